// Provider of the service that installs firmware, resets adapters and switches what a port can do.
//
// Every method waits for the agent's maps and then holds its data lock until it is through: a long
// download keeps everybody else who needs that lock waiting. Results are told in
// TVX_SoftwareInstallation.h and Service_Checks.h; a failure of the library is its status + 40000.
#pragma once

#include "generated/Records.h"
#include "runtime/Provider_Operations.h"

namespace cimrt {

class TVXHBA_SoftwareInstallationService_Provider {
 public:
  /// Installs the file of a path or URI. Answers 0 as well when the firmware waits for a reboot:
  /// `FWDownloadStatus` of the port is 40247 then.
  std::int32_t InstallFromURI(const TVXHBA_SoftwareInstallationService* service,
                              CIM_ConcreteJob*& job, const Property<String>& uri,
                              const CIM_ManagedElement* target,
                              const Property<Array<std::uint16_t>>& options,
                              const Property<Array<String>>& values,
                              Property<std::uint32_t>& return_value);
  /// Installs an image that came with the call, by way of the file that `values` names at the index
  /// of option 32768.
  std::int32_t InstallFromByteStream(const TVXHBA_SoftwareInstallationService* service,
                                     CIM_ConcreteJob*& job,
                                     const Property<Array<std::uint8_t>>& image,
                                     const CIM_ManagedElement* target,
                                     const Property<Array<std::uint16_t>>& options,
                                     const Property<Array<String>>& values,
                                     Property<std::uint32_t>& return_value);
  /// Resets the adapter and has the cache rebuilt.
  std::int32_t ResetHBA(const TVXHBA_SoftwareInstallationService* service,
                        const TVXHBA_FCPort* target, Property<std::uint32_t>& return_value);
  /// @param configStatus 5 when the setting waits for a reset
  std::int32_t SetPortEnabled(const TVXHBA_SoftwareInstallationService* service,
                              const TVXHBA_FCPort* target, const Property<bool>& portEnabled,
                              Property<std::uint8_t>& configStatus,
                              Property<std::uint32_t>& return_value);
  /// Appends the 512 bytes of the feature list to `features`.
  std::int32_t GetHBAFeatures(const TVXHBA_SoftwareInstallationService* service,
                              const TVXHBA_FCPort* target, Property<Array<std::uint8_t>>& features,
                              Property<std::uint32_t>& return_value);
  /// Switches forward error correction; the port's instance tells it at once.
  std::int32_t SetFECState(const TVXHBA_SoftwareInstallationService* service,
                           const TVXHBA_FCPort* target, const Property<bool>& enableFlag,
                           Property<std::uint32_t>& return_value);
};

}  // namespace cimrt
