// The driver's parameters as instances: built with the adapter maps, brought up to date when they
// are read.
#pragma once

#include <string>

#include "access/TVX_MethodWrapper.h"
#include "agent/ProviderAgent.h"

namespace cimrt {

/// Makes an instance of every parameter that the driver has for a port, or of every parameter of
/// its own, each tied to the service that sets it. 0; 1 for a name that is no local port's or an
/// instance that its map refuses, after which no more are made; 8 without memory; else the
/// library's status. The caller holds the agent's map and data locks.
/// @param deviceId 16 digits
RM_STATUS tvxcimGetDriverParam(ProviderAgent& agent, const std::string& deviceId,
                               TVX_Driver_Scope scope);

/// Takes the parameters' current values over to their instances; the active enumerations run them
/// with the agent's data lock held. Each asks the hardware at most once in five seconds, a failed
/// run counting as one. A port that can't be read ends the run: what was not reached keeps its
/// values.
void updateLocalDriverParams(ProviderAgent& agent);
void updateGlobalDriverParams(ProviderAgent& agent);

}  // namespace cimrt
