// Values and instances to and from JSON.
#pragma once

#include <nlohmann/json.hpp>

#include "cim/ClassCatalogue.h"
#include "cim/Value.h"

namespace tvx::host {

/// Numbers, booleans and texts as such, references as path texts, embedded instances as objects,
/// null as null.
nlohmann::ordered_json toJson(const Value& value);

/// {"path": ..., "class": ..., "properties": {...}}
nlohmann::ordered_json toJson(const Instance& instance);

/// Where JSON is read: descriptions that give types, and the namespace of paths without one.
struct JsonContext {
  const ClassCatalogue* classes = nullptr;
  std::string nameSpace;
};

/// Reads a value of a declared type (scalar code or array). Throws std::runtime_error naming what
/// does not fit. References are path texts; embedded instances are objects of the form above with
/// "class" instead of "path" if they have no keys.
Value valueFromJson(const nlohmann::ordered_json& json, CMPIType type, const JsonContext& context);

/// Reads a value of no declared type: {"type": "uint16", "value": 3}, or by what the JSON is
/// (string, boolean, sint64 or uint64, real64, array of one of them).
Value untypedFromJson(const nlohmann::ordered_json& json, const JsonContext& context);

/// Reads {"class", "namespace"?, "properties", "keys"?}: types from the class if it is known. The
/// path's keys are the class's keys, or those named in "keys".
Instance instanceFromJson(const nlohmann::ordered_json& json, const JsonContext& context);

}  // namespace tvx::host
