// From a scenario file to a world.
#pragma once

#include <string>

#include "state/Json_Reader.h"
#include "state/World.h"

namespace tvx::sim {

/// Builds the world that the text describes. Throws Scenario_Error on anything that is malformed;
/// `name` stands in World::scenario.
World parse_scenario(const std::string& text, const std::string& name);

/// Reads and parses a file; an unreadable file is a Scenario_Error too.
World load_scenario(const std::string& path);

/// The scenario that is used when none is named.
World default_scenario();

}  // namespace tvx::sim
