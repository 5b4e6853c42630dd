// The software of the host as CIM instances: the provider itself, the drivers, the diagnostics, and
// what runs on each port.
#pragma once

#include <string>

#include "agent/MapBuild.h"

namespace cimrt {

/// Maker of the provider's own software, and of software whose maker is not told.
inline constexpr const char* TORVEX_CORPORATION = "Torvex Corporation";

/// Values of `Classifications`.
enum Software_Classification : std::uint16_t {
  SOFTWARE_DRIVER = 2,
  SOFTWARE_APPLICATION = 4,
  SOFTWARE_DIAGNOSTIC = 7,
  SOFTWARE_FIRMWARE = 10,
  SOFTWARE_BOOT_CODE = 11
};

/// "10.2.107-7".
std::string providerVersionText();
/// `InstanceID` of the provider's identity: "Torvex CMPI HBA Provider v10.2.107-7".
std::string providerIdentityInstanceID();
/// `InstanceID` of the identity of an adapter's driver.
std::string driverIdentityInstanceID(const FCAdapterAttributes& attributes);

/// Build step: the identity of the provider, tied to the system and to the "Software" profile.
/// Fails when it can't be inserted.
std::int32_t buildProviderIdentity(Host_Build& host);

/// Build step: driver and diagnostics identities of every FC adapter. Those that an earlier adapter
/// made are used as they stand. Fails when a new one can't be inserted.
std::int32_t CreateDriverIdentity(Host_Build& host);

/// Build step: firmware, kernel, boot code and stub of a port, and its driver. A refused insert of
/// an identity that another port made is logged and stops nothing: the entry serves this port too.
std::int32_t buildPortSoftware(Port_Build& port);

}  // namespace cimrt
