// What the builders of the adapter maps hand on to one another.
//
// `updateAdapterMaps` runs three tables of steps over these records: once for the host, once for
// each FC adapter, once for each of its ports. All pointers are to entries of the agent's maps
// (owned by the maps) or into the device tree, and hold for the length of one build; null means
// that the step which makes the instance did not, and steps that need it leave their associations
// out. Everything here runs on the refresh thread with the agent's map and data locks held.
#pragma once

#include <cstdint>
#include <string>

#include "agent/ProviderAgent.h"
#include "generated/Records.h"
#include "model/TVX_Data.h"

namespace cimrt {

/// Namespace of the provider's instances, and that of the platform's own classes.
inline constexpr const char* PROVIDER_NAME_SPACE = "root/torvex";
inline constexpr const char* PLATFORM_NAME_SPACE = "root/ibmse";

/// Kind of an adapter's chip.
enum class Chip_Kind : int { E200 = 1, SUB_ADAPTER = 2, OTHER = 3 };

/// PCI device id of the adapters that have a firmware identity only.
inline constexpr std::uint32_t E200_DEVICE_ID = 0xE200;

/// What all adapters of the host share.
struct Host_Build {
  ProviderAgent& agent;
  CIM_ComputerSystem* system = nullptr;  ///< entry 0 of its map
  Ref<CIM_Chassis> platformChassis{};    ///< found by the up-call; in no map
  CIM_Chassis* chassis = nullptr;        ///< the platform's or our own
  std::string firstPortName{};           ///< WWPN of port 0 of the first FC adapter, or empty
  TVXHBA_SoftwareIdentity* providerIdentity = nullptr;
  TVXHBA_SoftwareIdentity* driverIdentity = nullptr;
  TVXHBA_SoftwareInstallationService* installationService = nullptr;
  TVXHBA_FCHBAWWNService* wwnService = nullptr;
  TVXHBA_FCTagService* tagService = nullptr;
  TVXHBA_BootBIOSService* bootBIOSService = nullptr;
  TVXHBA_FCHBADriverParamService* driverParamService = nullptr;
  TVXHBA_RemoteServiceAccessPoint* accessPoint = nullptr;
};

/// One FC adapter.
struct Adapter_Build {
  Host_Build& host;
  FCAdapter& adapter;
  const FCAdapterAttributes& attributes;
  std::uint32_t index = 0;  ///< position in the device tree
  TVXHBA_Product* product = nullptr;
  TVXHBA_LogicalPortGroup* portGroup = nullptr;
  TVXHBA_Card* card = nullptr;
  bool cardIsNew = false;  ///< the card was made for this adapter, and not found
};

/// One port of it.
struct Port_Build {
  Adapter_Build& adapter;
  FCPort& port;
  const FCPortAttributes& attributes;
  Chip_Kind chipKind = Chip_Kind::OTHER;
  TVXHBA_Chip* chip = nullptr;
  TVXHBA_PCIDevice* pciDevice = nullptr;
  TVXHBA_PhysicalConnector* connector = nullptr;
  TVXHBA_FCPort* fcPort = nullptr;
  TVXHBA_SCSIProtocolController* scsiController = nullptr;
  TVXHBA_PortController* controller = nullptr;
};

/// What a step answers, beside 0 for "go on" and MAP_BUILD_FAILED for "end the whole build; the
/// maps stay as far as they got": no more classes for this port, and on with the next one.
inline constexpr std::int32_t MAP_BUILD_LEAVE_PORT = 0x8000;

/// One step of a build, for the tables that show the order.
template <class Build>
using Build_Step = std::int32_t (*)(Build& build);

/// Runs a table of steps until one does not answer 0. Its answer, or 0.
template <class Build, std::size_t N>
std::int32_t runSteps(const Build_Step<Build> (&steps)[N], Build& build) {
  for (const Build_Step<Build> step : steps)
    if (const std::int32_t result = step(build); result != 0) return result;
  return 0;
}

}  // namespace cimrt
