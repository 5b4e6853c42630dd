// Provider of the service that sets driver parameters and ends optimized access.
#pragma once

#include "generated/Records.h"
#include "runtime/Provider_Operations.h"

namespace cimrt {

class TVXHBA_FCHBADriverParamService_Provider {
 public:
  /// Sets one parameter. Its instance is not touched: `current` follows when it is read anew.
  /// @param bPermanent the change outlives a reboot
  /// @param bGlobal the driver's parameter, not the port's
  std::int32_t SetDriverParameter(const TVXHBA_FCHBADriverParamService* service,
                                  const TVXHBA_FCPort* target, const Property<bool>& bPermanent,
                                  const Property<bool>& bGlobal, const Property<String>& strParam,
                                  const Property<String>& strValue,
                                  Property<std::uint32_t>& return_value);
  /// Takes the marks of units behind a target away, those of the driver and those of the stored
  /// configuration. Of units that stand side by side one call takes every second.
  std::int32_t DisableAllOASLuns(const TVXHBA_FCHBADriverParamService* service,
                                 const Property<String>& InitiatorWWPN,
                                 const Property<String>& TargetWWPN,
                                 Property<std::uint32_t>& return_value);
};

}  // namespace cimrt
