// What the methods of the services have in common: how a call begins, and whom it is for.
#pragma once

#include <cstdint>

#include "agent/ProviderAgent.h"
#include "agent/Service_Call.h"
#include "generated/Records.h"
#include "rmapi/rmapi.h"

namespace cimrt {

/// Results that several methods share.
inline constexpr std::uint32_t METHOD_OK = 0;
inline constexpr std::uint32_t METHOD_UNKNOWN_PORT = 32968;
inline constexpr std::uint32_t METHOD_UNKNOWN_SERVICE = 33068;
/// A failure of the library is answered as its status above this.
inline constexpr std::uint32_t METHOD_LIBRARY_FAILURE = 40000;

/// True if the map of a service holds this one, by its keys. An empty map knows every service.
bool isKnownService(const Instance_Map_Base& map, const Instance* service);

/// The agent's port of that device id, or null with the failure logged. The caller holds the data
/// lock; the map keeps owning the port.
TVXHBA_FCPort* findFCPort(ProviderAgent& agent, const char* deviceID);
/// The same for the target of a method, which may be null or an instance of any class: what is no
/// port at all gives null with nothing logged.
TVXHBA_FCPort* findTargetPort(ProviderAgent& agent, const Instance* target);

/// The agent's port with the device id of `target`, an instance of any class. Null, with nothing
/// logged, if the class has no such property.
TVXHBA_FCPort* findPortOfDevice(ProviderAgent& agent, const Instance* target);

/// Turns a port's device id into its name. False with "<owner>::Id2HBAName failed" or
/// "<owner>::str2HBAName failed" logged at `TVX_ERR`; a null id counts as the former.
bool convertPortName(const char* owner, const Property<String>& deviceID, HBA_WWN& wwpn);

/// How the methods of one service refuse a call.
struct Service_Texts {
  const char* unknownService;
  const char* unknownPort;
  const char* owner;  ///< as `convertPortName` takes it
};

/// What every method of a service does first: knows the service, finds the port that is meant and
/// takes its name. METHOD_OK, or the result of the method with the reason logged at `TVX_ERR`. The
/// caller holds the data lock.
std::uint32_t openServiceCall(ProviderAgent& agent, const Instance_Map_Base& services,
                              const Instance* service, const Instance* target,
                              const Service_Texts& texts, HBA_WWN& wwpn);

}  // namespace cimrt
