// Provider of the service that reads, changes and restores the world wide names of a port.
#pragma once

#include "generated/Records.h"

namespace cimrt {

/// Results beside the common ones: 32969 for a new name that is empty, 40005 for one that the
/// library calls invalid, 91 for one that a virtual port of this host has. Every method holds the
/// agent's data lock to its end, also while it waits for a busy adapter.
class TVXHBA_FCHBAWWNService_Provider {
 public:
  /// Gives a port new names, which act after a reset or a reboot; the cache is refreshed.
  /// @param newWWPN,newWWNN 16 hexadecimal digits
  /// @param type 0 volatile, 1 non-volatile
  /// @param operationStatus what has to follow, or the kind of a duplicate; else 65535
  std::int32_t ChangeWWN(const TVXHBA_FCHBAWWNService* service, const TVXHBA_FCPort* target,
                         const Property<String>& newWWPN, const Property<String>& newWWNN,
                         const Property<std::uint16_t>& type,
                         Property<std::uint16_t>& operationStatus,
                         Property<std::uint32_t>& return_value);
  /// Puts names back. A library that fails shows only in an operation status of 65535.
  /// @param type 0 factory default, 1 non-volatile
  std::int32_t RestoreWWN(const TVXHBA_FCHBAWWNService* service, const TVXHBA_FCPort* target,
                          const Property<std::uint16_t>& type,
                          Property<std::uint16_t>& operationStatus,
                          Property<std::uint32_t>& return_value);
  /// @param type 0 volatile, 1 non-volatile, 2 factory default, 3 current, 4 configured
  /// @param wwpn,wwnn lower-case pairs of digits with colons; not set where there are no names
  std::int32_t ReadWWN(const TVXHBA_FCHBAWWNService* service, const TVXHBA_FCPort* target,
                       const Property<std::uint16_t>& type, Property<String>& wwpn,
                       Property<String>& wwnn, Property<std::uint16_t>& operationStatus,
                       Property<std::uint32_t>& return_value);
  /// @param capability bits: 4 and 8 for what can be changed, 0x1000 and 0x2000 for what has to
  /// follow, 0x8000 for read-only
  std::int32_t GetWWNCapability(const TVXHBA_FCHBAWWNService* service, const TVXHBA_FCPort* target,
                                Property<std::uint32_t>& capability,
                                Property<std::uint32_t>& return_value);
};

}  // namespace cimrt
