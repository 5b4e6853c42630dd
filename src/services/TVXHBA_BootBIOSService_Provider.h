// Provider of the service that turns the boot code of a port on and off.
#pragma once

#include "generated/Records.h"

namespace cimrt {

/// The target is taken by its `DeviceID`, whatever its class. No method touches the cache.
class TVXHBA_BootBIOSService_Provider {
 public:
  std::int32_t EnableBootBIOS(const TVXHBA_BootBIOSService* service, const TVXHBA_FCPort* target,
                              Property<std::uint32_t>& return_value);
  std::int32_t DisableBootBIOS(const TVXHBA_BootBIOSService* service, const TVXHBA_FCPort* target,
                               Property<std::uint32_t>& return_value);
  /// @param state the library's byte, 0 for off; left as it was on failure
  std::int32_t GetBootBIOSStatus(const TVXHBA_BootBIOSService* service, const TVXHBA_FCPort* target,
                                 Property<std::uint32_t>& state,
                                 Property<std::uint32_t>& return_value);
};

}  // namespace cimrt
