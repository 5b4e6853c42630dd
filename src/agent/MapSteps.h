// The steps that refill the adapter maps, by topic. Each answers 0 or MAP_BUILD_FAILED; a step of
// a port may also answer MAP_BUILD_LEAVE_PORT. The tables in AdapterMaps.cpp give their order.
#pragma once

#include "agent/MapBuild.h"

namespace cimrt {

// --- Host (ComputerSystem.cpp, Chassis.cpp, RecordLog.cpp)

/// Takes the platform's computer system over, or makes one from what the host says of itself, and
/// puts it into its map as entry 0.
std::int32_t buildComputerSystem(Host_Build& host);
/// Looks for the platform's chassis. Finding none is no failure.
std::int32_t findPlatformChassis(Host_Build& host);
/// Makes a chassis where the platform has none.
std::int32_t buildOwnChassis(Host_Build& host);
/// The provider's record log with its capabilities, its profile and its writer.
std::int32_t buildRecordLog(Host_Build& host);

// --- Adapter (PackageInstances.cpp, CardInstances.cpp)

/// Product and port group of the adapter, each found by its name or made.
std::int32_t CreatePackageInstances(Adapter_Build& build);
/// The card, found by its serial number or made.
std::int32_t CreateCardInstances(Adapter_Build& build);

// --- Port (CardInstances.cpp, ChipInstances.cpp, PhysicalConnectorInstances.cpp)

/// Associations of a card that was made for this adapter. Its failures are logged and not looked
/// at: a card with two ports makes them twice.
std::int32_t associateNewCard(Port_Build& build);
/// Works the kind of the port's chip out of its adapter's attributes.
std::int32_t classifyChip(Port_Build& build);
/// The chip, found by its tag or made with its associations.
std::int32_t CreateChipInstances(Port_Build& build);
/// The connector with its associations.
std::int32_t CreatePhysicalConnectorInstances(Port_Build& build);

// --- Port (PCIDevice.cpp)

/// The port as a PCI device, with its registers.
std::int32_t CreatePCIDeviceInstance(Port_Build& build);

// --- Port (FCPortInstance.cpp)

/// The port's own instance, in its map.
std::int32_t insertFCPort(Port_Build& build);
/// Its places in the system and in the port group.
std::int32_t associateFCPort(Port_Build& build);
/// Its statistics, unset until they are first read.
std::int32_t buildPortStatistics(Port_Build& build);
/// The management page's access point, for the port, if there is one. Never a failure of the build.
std::int32_t offerAccessPoint(Port_Build& build);

// --- Port (PortConformance.cpp). Failures are logged and not looked at.

std::int32_t conformFCPort(Port_Build& build);
std::int32_t conformPortController(Port_Build& build);

// --- Port (PortControllers.cpp)

std::int32_t buildSCSIController(Port_Build& build);
std::int32_t buildPortController(Port_Build& build);
/// What the port controller controls, what realizes it and where it stands.
std::int32_t associatePortController(Port_Build& build);
std::int32_t buildInitiatorEndpoint(Port_Build& build);

}  // namespace cimrt
