// How the classes answer whose values move between two refreshes.
#pragma once

#include "agent/ProviderAgent.h"

namespace cimrt {

/// Brings the entries of a class up to date and delivers them; an agent without its libraries has
/// nothing to deliver, which is no failure. Always 0.
/// @param className the CIM class, after which its provider is named
template <class T>
std::int32_t enumerateActive(const char* className, Instance_Map<T> Agent_Maps::*map,
                             const Instance_Handler& handler, Live_Update update) {
  ProviderAgent& agent = *ProviderAgent::getInstance();
  if (!agent.isLoaded()) {
    TVX_LOG(TVX_DBG, "RM Init failed for %s_Provider.cpp", className);
    return ENUM_INSTANCES_OK;
  }
  TVX_LOG(TVX_DBG, "%s_Provider::enum_instances()", className);
  agent.enumActiveInstances(agent.*map, handler, update);
  return ENUM_INSTANCES_OK;
}

}  // namespace cimrt
