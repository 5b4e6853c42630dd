// Methods of a service that acts on one port, as the commands call them.
#pragma once

#include <cstdint>
#include <string>

#include "cli/ExitCode.h"
#include "cli/Requests.h"

namespace tvx::host {

/// One port and the service that acts on it.
struct ServicePort {
  Instance service;
  Instance port;
  std::string wwpn;  ///< of the port, in pairs
};

/// Finds both. Throws CommandError.
ServicePort findServicePort(Session& session, const char* serviceClass, const std::string& words);

/// Calls a method with `Target` and the further arguments.
Reply callOnPort(Session& session, const ServicePort& on, const char* method,
                 NamedValues arguments = {});

/// A number that the method gave back; `missing` where it gave none.
std::uint64_t outputNumber(const Reply& reply, const char* name, std::uint64_t missing);
/// A text that it gave back; empty where it gave none.
std::string outputText(const Reply& reply, const char* name);

/// A method's result above this is a status of the adapter library, which has been added to it.
inline constexpr std::uint64_t libraryFailure = 40000;

/// What the result of a method means, in words.
std::string resultWords(std::uint64_t result);

/// Tells how a method that changes something ended: in a line, or as JSON under `member` with its
/// further members.
ExitCode tellOutcome(Session& session, const char* member, const std::string& wwpn,
                     std::uint64_t result, const std::string& said,
                     nlohmann::ordered_json further = nlohmann::ordered_json::object());

}  // namespace tvx::host
