// Writing what a command found: tables, JSON and MOF.
#pragma once

#include <nlohmann/json.hpp>
#include <string>
#include <vector>

#include "Broker.h"

namespace tvx::host {

/// Version of the JSON that tvxcim prints; raised when a member changes its meaning.
inline constexpr int jsonVersion = 1;

/// {"version": 1, "command": command}, to be filled.
nlohmann::ordered_json jsonHead(const std::string& command);

/// MOF of one instance: `instance of Class { Name = value; };` with every property that is set.
std::string mofText(const Instance& instance);

/// MOF form of a value: "text", 12, TRUE, {1, 2}, "path", NULL.
std::string mofValue(const Value& value);

/// A path for a table: class and telling keys, without namespace and without the keys that name
/// only system and class.
std::string shortPath(const ObjectPath& path);

/// Table of instances of one class: the telling keys and a few more, or exactly `properties`.
std::string instanceTable(const std::vector<Instance>& instances, const PropertyList& properties);

/// All properties of one instance, one a line.
std::string instanceDetails(const Instance& instance);

}  // namespace tvx::host
