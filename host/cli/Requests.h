// Requests as the families of commands make them, and the JSON they print.
#pragma once

#include <nlohmann/json.hpp>
#include <string>
#include <vector>

#include "cli/Session.h"

namespace tvx::host {

/// All instances of a class. Throws CommandError if the provider refuses.
std::vector<Instance> instancesOf(Session& session, const std::string& className);

/// The one instance of a class, such as a service. Throws CommandError (NotFound) if there is none
/// or more than one.
Instance onlyInstanceOf(Session& session, const std::string& className);

/// The port that `words` name: a WWPN in any usual spelling, or a path that may leave keys out.
/// Throws CommandError (NotFound) that lists the ports there are.
Instance findPort(Session& session, const std::string& words);

/// Calls a method. Throws CommandError for a CIM error; the method's own result is in the reply.
Reply callMethod(Session& session, const ObjectPath& path, const std::string& method,
                 NamedValues arguments);

/// The method's numeric result. Throws CommandError (CimError) if there is none.
std::uint64_t resultNumber(const Reply& reply);

/// Prints {"version": 1, "command": ..., member: content}.
void printJson(Session& session, const char* member, nlohmann::ordered_json content);

}  // namespace tvx::host
