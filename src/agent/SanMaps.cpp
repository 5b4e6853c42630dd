// The order in which the SAN maps are refilled.
#include <exception>

#include "agent/SanBuild.h"

namespace cimrt {

namespace {

// --- One logical unit ----------------------------------------------------------------------------

/// One entry serves all units behind a remote port.
std::int32_t notePortTarget(San_Unit_Build& build) {
  build.port.san.portTargets.insert(build.texts.port + "|" + build.texts.target);
  return 0;
}

// clang-format off
constexpr Build_Step<San_Unit_Build> UNIT_STEPS[] = {
    notePortTarget,
    buildTargetEndpoint,
    hostTargetEndpoint,
    buildDevice,
};
// clang-format on

std::int32_t buildUnit(San_Port_Build& port, std::size_t index, std::size_t count) {
  TVX_LOG(TVX_DBG, "Creating classes for target %d of %d.", static_cast<int>(index),
          static_cast<int>(count));
  const Target& target = *port.port.getTarget(static_cast<int>(index));
  San_Unit_Build build{port, target, index, unitTexts(port.port.m_Name, target)};
  return runSteps(UNIT_STEPS, build);
}

// --- One port ------------------------------------------------------------------------------------

std::int32_t buildUnits(San_Port_Build& build) {
  const std::size_t count = build.port.getNumberOfTargets();
  for (std::size_t i = 0; i < count; i++)
    if (const std::int32_t result = buildUnit(build, i, count); result != 0) return result;
  return 0;
}

// clang-format off
constexpr Build_Step<San_Port_Build> PORT_STEPS[] = {
    findInitiatorEndpoint,
    buildUnits,
};
// clang-format on

std::int32_t buildPort(San_Build& san, FCAdapter& adapter, std::size_t position) {
  TVX_LOG(TVX_DBG, "Creating classes for port %d.", static_cast<int>(position));
  // A port of another kind cannot stand under an FC adapter: the cast throws.
  auto& port = dynamic_cast<FCPort&>(*adapter.getPort(static_cast<int>(position)));
  San_Port_Build build{san, port};
  return runSteps(PORT_STEPS, build);
}

// --- One adapter ---------------------------------------------------------------------------------

std::int32_t buildAdapter(San_Build& san, std::uint32_t index) {
  Adapter& adapter = *san.agent.m_pData->m_Adapters.at(index);
  if (adapter.m_Type != TVX_ADAPTER_TYPE_FC) {
    TVX_LOG(TVX_DBG, "Skippping Adapter [%s] since it is not an FC Adapter",
            adapter.getName().c_str());
    return 0;
  }
  auto& fcAdapter = dynamic_cast<FCAdapter&>(adapter);
  const std::size_t count = fcAdapter.getNumberOfPorts();
  for (std::size_t i = 0; i < count; i++)
    if (const std::int32_t result = buildPort(san, fcAdapter, i); result != 0) return result;
  return 0;
}

// --- The host ------------------------------------------------------------------------------------

std::int32_t findHostingSystem(San_Build& build) {
  if (build.agent.m_CIM_ComputerSystem_map.size() > 0)
    build.system = build.agent.m_CIM_ComputerSystem_map[0];
  return 0;
}

/// An exception ends the whole build; what was inserted before stays in the maps.
std::int32_t buildAdapters(San_Build& build) {
  try {
    if (!build.agent.m_pData) throw std::exception();
    for (std::uint32_t i = 0; i < build.agent.m_pData->m_AdapterCount; i++)
      if (const std::int32_t result = buildAdapter(build, i); result != 0) return result;
  } catch (...) {
    TVX_LOG(TVX_ERR, "Error updating SAN maps");
    return MAP_BUILD_FAILED;
  }
  return 0;
}

// clang-format off
constexpr Build_Step<San_Build> SAN_STEPS[] = {
    findHostingSystem,
    buildAdapters,
    visitPortTargets,
};
// clang-format on

}  // namespace

std::int32_t ProviderAgent::updateSANMaps() {
  TVX_LOG(TVX_DBG, "PERF: updateSANMaps: Entry");
  clearSANMaps();
  San_Build build{*this};
  if (const std::int32_t result = runSteps(SAN_STEPS, build); result != 0) return result;
  TVX_LOG(TVX_DBG, "PERF: updateSANMaps: cleanExit");
  return 0;
}

}  // namespace cimrt
