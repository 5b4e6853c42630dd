// Steps of the adapter maps that the folders of the services, the logs and the diagnostics
// implement: product data, transceivers, flash contents, driver log, virtual ports, tests. They are
// declared here because the agent's tables name them.
#pragma once

#include "agent/MapBuild.h"

namespace cimrt {

/// Takes the field replaceable unit's data over to the card. The chip's kind must be known.
std::int32_t updateCardFromFRU(Port_Build& build);
/// The port's vital product data, tied to its PCI device. A port without them is no failure.
std::int32_t buildVitalProductData(Port_Build& build);
/// The port's transceiver, tied to its controller. A port without one is no failure.
std::int32_t buildTransceiver(Port_Build& build);
/// The programs in the port's flash, tied to the port. A port without them is no failure.
std::int32_t buildFlashImages(Port_Build& build);
/// Takes the unit's data over to the software of the ports. Never a failure of the build.
std::int32_t updateSoftwareFromFRU(Host_Build& host);
/// The driver's parameters, of its own and of every port, and its tie to the service that sets
/// them. Read anew at most once in five seconds, refreshes included. Never a failure of the build.
std::int32_t buildDriverParameters(Host_Build& host);
/// Tells in the log that the dump classes come.
std::int32_t announceDumpClasses(Host_Build& host);
/// The dump service and the settings of every port's dumps. Never a failure of the build.
std::int32_t buildDumpClasses(Host_Build& host);
/// The driver's record log, for the first FC adapter. Never a failure of the build.
std::int32_t buildDriverLog(Host_Build& host);
/// The virtual ports and their pools. Never a failure of the build.
std::int32_t buildVirtualPorts(Host_Build& host);

/// Step of the SAN build for one port and one remote port behind it, given as device ids: the units
/// that are marked for optimized access, and what their list tells of the port's chip, which may be
/// null. Failures are logged and leave units out.
void readOptimizedAccess(ProviderAgent& agent, const std::string& port, const std::string& target,
                         TVXHBA_Chip* chip);

/// The diagnostic tests with all that belongs to them. Never a failure of the build.
std::int32_t buildDiagnostics(Host_Build& host);
/// Empties the maps of the tests; what earlier runs left behind stays.
void clearDiagnosticClasses(ProviderAgent& agent);

/// Empties the maps of the virtual ports. Always 0.
std::int32_t ClearPortVirtualizationMaps(Agent_Maps& maps);

}  // namespace cimrt
