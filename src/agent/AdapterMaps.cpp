// The order in which the adapter maps are refilled.
#include <exception>

#include "agent/HostedServices.h"
#include "agent/MapSteps.h"
#include "agent/ProductSteps.h"
#include "agent/ProviderConfigSettings.h"
#include "agent/RegisteredProfiles.h"
#include "agent/SoftwareIdentities.h"

namespace cimrt {

namespace {

// --- One port ------------------------------------------------------------------------------------

// clang-format off
constexpr Build_Step<Port_Build> PORT_STEPS[] = {
    classifyChip,
    updateCardFromFRU,
    associateNewCard,
    CreateChipInstances,
    CreatePCIDeviceInstance,
    buildVitalProductData,
    CreatePhysicalConnectorInstances,
    insertFCPort,
    conformFCPort,
    associateFCPort,
    buildPortStatistics,
    buildSCSIController,
    buildPortController,
    conformPortController,
    buildTransceiver,
    buildFlashImages,
    associatePortController,
    buildInitiatorEndpoint,
    buildPortSoftware,
    offerAccessPoint,
    buildServiceAssociations,
};
// clang-format on

std::int32_t buildPort(Adapter_Build& adapter, int position) {
  TVX_LOG(TVX_DBG, "Creating classes for port %d.", position);
  auto* port = dynamic_cast<FCPort*>(adapter.adapter.getPort(position));
  const auto* attributes =
      port ? dynamic_cast<const FCPortAttributes*>(port->getAttributes()) : nullptr;
  if (!attributes) {
    TVX_LOG(TVX_ERR, "Port %d of adapter [%s] is no FC port", position,
            adapter.adapter.getName().c_str());
    return MAP_BUILD_FAILED;
  }
  Port_Build build{adapter, *port, *attributes};
  const std::int32_t result = runSteps(PORT_STEPS, build);
  return result == MAP_BUILD_LEAVE_PORT ? 0 : result;
}

// --- One adapter ---------------------------------------------------------------------------------

std::int32_t buildPorts(Adapter_Build& build) {
  const std::size_t count = build.adapter.getNumberOfPorts();
  for (std::size_t i = 0; i < count; i++)
    if (const std::int32_t result = buildPort(build, static_cast<int>(i)); result != 0)
      return result;
  return 0;
}

constexpr Build_Step<Adapter_Build> ADAPTER_STEPS[] = {
    CreatePackageInstances,
    CreateCardInstances,
    buildPorts,
};

std::int32_t buildAdapter(Host_Build& host, std::uint32_t index) {
  Adapter& adapter = *host.agent.m_pData->m_Adapters.at(index);
  if (adapter.m_Type != TVX_ADAPTER_TYPE_FC) {
    TVX_LOG(TVX_DBG, "Skippping Non FC Adapter [%s]", adapter.getName().c_str());
    return 0;
  }
  auto* fcAdapter = dynamic_cast<FCAdapter*>(&adapter);
  const auto* attributes = dynamic_cast<const FCAdapterAttributes*>(adapter.getAttributes());
  if (!fcAdapter || !attributes) {
    TVX_LOG(TVX_ERR, "Adapter [%s] is no FC adapter", adapter.getName().c_str());
    return MAP_BUILD_FAILED;
  }
  Adapter_Build build{host, *fcAdapter, *attributes, index};
  return runSteps(ADAPTER_STEPS, build);
}

// --- The host ------------------------------------------------------------------------------------

std::int32_t requireDeviceTree(Host_Build& host) {
  if (host.agent.m_pData) return 0;
  TVX_LOG(TVX_CRIT, "Could not locate the data pointer - Serious issue");
  return MAP_BUILD_FAILED;
}

/// Keeps the name of port 0 of the first FC adapter; it stays empty without such a port.
std::int32_t findFirstPort(Host_Build& host) {
  for (Adapter* adapter : host.agent.m_pData->m_Adapters) {
    if (adapter->m_Type != TVX_ADAPTER_TYPE_FC) continue;
    if (adapter->getNumberOfPorts() > 0) host.firstPortName = adapter->getPort(0)->m_Name;
    break;
  }
  return 0;
}

/// An exception ends the walk over the adapters; what comes after it is still built.
std::int32_t buildAdapters(Host_Build& host) {
  try {
    for (std::uint32_t i = 0; i < host.agent.m_pData->m_AdapterCount; i++)
      if (const std::int32_t result = buildAdapter(host, i); result != 0) return result;
  } catch (...) {
    TVX_LOG(TVX_CRIT, "Unknown Exception in FC card discovery");
  }
  return 0;
}

// clang-format off
constexpr Build_Step<Host_Build> CARD_STEPS[] = {
    findFirstPort,
    buildProviderIdentity,
    buildProviderConfigSettings,
    startServices,
    buildAdapters,
    buildDriverParameters,
    announceDumpClasses,
    buildDriverLog,
    buildDumpClasses,
    buildVirtualPorts,
};
// clang-format on

std::int32_t buildCards(Host_Build& host) {
  if (!host.agent.m_pData->m_bFCCardFound) {
    TVX_LOG(TVX_DBG, "No FC card found");
    return 0;
  }
  return runSteps(CARD_STEPS, host);
}

// clang-format off
constexpr Build_Step<Host_Build> HOST_STEPS[] = {
    buildComputerSystem,
    findPlatformChassis,
    registerBaseProfiles,
    requireDeviceTree,
    buildOwnChassis,
    buildCards,
    buildDiagnostics,
    updateSoftwareFromFRU,
    buildRecordLog,
};
// clang-format on

}  // namespace

std::int32_t ProviderAgent::updateAdapterMaps() {
  TVX_LOG(TVX_DBG, " updateAdapterMaps: Entry");
  clearAdapterMaps();
  Host_Build host{*this};
  if (const std::int32_t result = runSteps(HOST_STEPS, host); result != 0) return result;
  TVX_LOG(TVX_DBG, "Create the Diagnostic classes");
  TVX_LOG(TVX_DBG, "PERF: updateAdapterMaps: cleanExit");
  return 0;
}

}  // namespace cimrt
