#include "cli/Requests.h"

#include <fmt/format.h>

#include <algorithm>
#include <cctype>

#include "cli/Output.h"
#include "cli/Ports.h"

namespace tvx::host {
namespace {

/// Sixteen lower-case hexadecimal digits out of "10:00:...", "0x1000..." and the like; "" for a
/// text that is no World Wide Name.
std::string plainName(const std::string& words) {
  std::string digits;
  for (const char c : words.starts_with("0x") ? words.substr(2) : words) {
    if (std::isxdigit(static_cast<unsigned char>(c)) != 0) {
      digits += static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
    } else if (c != ':' && c != '-' && c != '.') {
      return {};
    }
  }
  return digits.size() == 16 ? digits : std::string();
}

std::string portNames(const std::vector<Instance>& ports) {
  if (ports.empty()) {
    return "there are no FC ports";
  }
  std::vector<std::string> names;
  for (const Instance& port : ports) {
    names.push_back(wwnText(port.text("DeviceID")));
  }
  return fmt::format("the ports are {}", fmt::join(names, ", "));
}

}  // namespace

std::vector<Instance> instancesOf(Session& session, const std::string& className) {
  Request request;
  request.operation = Operation::EnumerateInstances;
  request.path.className = className;
  return session.run(request).instances;
}

Instance onlyInstanceOf(Session& session, const std::string& className) {
  std::vector<Instance> found = instancesOf(session, className);
  if (found.size() != 1) {
    throw CommandError(
        ExitCode::NotFound,
        found.empty()
            ? fmt::format("there is no instance of {}; is there an adapter? "
                          "'tvxcim ports' shows them",
                          className)
            : fmt::format("there are {} instances of {}, one is needed", found.size(), className));
  }
  return std::move(found.front());
}

Instance findPort(Session& session, const std::string& words) {
  const std::string name = plainName(words);
  std::string wanted = name;
  if (name.empty() && words.find("TVXHBA_") != std::string::npos) {
    wanted = plainName(session.resolve(words).key("DeviceID").display());
  }
  const std::vector<Instance> ports = instancesOf(session, "TVXHBA_FCPort");
  for (const Instance& port : ports) {
    if (!wanted.empty() && plainName(port.text("DeviceID")) == wanted) {
      return port;
    }
  }
  throw CommandError(ExitCode::NotFound,
                     fmt::format("there is no port '{}'; {}", words, portNames(ports)));
}

Reply callMethod(Session& session, const ObjectPath& path, const std::string& method,
                 NamedValues arguments) {
  Request request;
  request.operation = Operation::InvokeMethod;
  request.path = path;
  request.method = method;
  request.arguments = std::move(arguments);
  return session.run(request);
}

std::uint64_t resultNumber(const Reply& reply) {
  const Value& value = reply.returnValue;
  if (value.isNull() || value.type() < CMPI_uint8 || value.type() > CMPI_sint64) {
    throw CommandError(ExitCode::CimError, "the method answered without a result number");
  }
  return value.asUnsigned();
}

void printJson(Session& session, const char* member, nlohmann::ordered_json content) {
  nlohmann::ordered_json json = jsonHead(session.options().command);
  json[member] = std::move(content);
  // What the hardware and the system log say may be no UTF-8.
  session.out() << json.dump(2, ' ', false, nlohmann::ordered_json::error_handler_t::replace)
                << "\n";
}

}  // namespace tvx::host
