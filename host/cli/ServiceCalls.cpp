#include "cli/ServiceCalls.h"

#include <fmt/format.h>

#include "cli/Ports.h"

namespace tvx::host {
namespace {

struct ResultText {
  std::uint64_t result;
  const char* text;
};

constexpr ResultText resultTexts[] = {
    {0, "done"},
    {91, "a virtual port of this host has that name already"},
    {32968, "the port or one of the values is not known to the provider"},
    {32969, "a name is empty"},
    {33068, "the service is not known to the provider"},
    {libraryFailure + 1, "the adapter library failed"},
    {libraryFailure + 5, "the adapter library calls a name invalid"},
    {libraryFailure + 89, "the adapter does not support it"},
    {libraryFailure + 92, "names cannot be managed on this adapter"},
    {libraryFailure + 97, "the adapter stayed busy"},
};

}  // namespace

ServicePort findServicePort(Session& session, const char* serviceClass, const std::string& words) {
  ServicePort found;
  found.port = findPort(session, words);
  found.service = onlyInstanceOf(session, serviceClass);
  found.wwpn = wwnText(found.port.text("DeviceID"));
  return found;
}

Reply callOnPort(Session& session, const ServicePort& on, const char* method,
                 NamedValues arguments) {
  arguments.set("Target", Value::reference(on.port.path));
  return callMethod(session, on.service.path, method, std::move(arguments));
}

std::uint64_t outputNumber(const Reply& reply, const char* name, std::uint64_t missing) {
  const Value* const value = reply.outputs.find(name);
  return value == nullptr || value->isNull() ? missing : value->asUnsigned();
}

std::string outputText(const Reply& reply, const char* name) {
  const Value* const value = reply.outputs.find(name);
  return value == nullptr || value->isNull() ? std::string() : value->asText();
}

std::string resultWords(std::uint64_t result) {
  for (const ResultText& row : resultTexts) {
    if (row.result == result) {
      return row.text;
    }
  }
  return result > libraryFailure
             ? fmt::format("the adapter library failed with status {}", result - libraryFailure)
             : "failed";
}

ExitCode tellOutcome(Session& session, const char* member, const std::string& wwpn,
                     std::uint64_t result, const std::string& said,
                     nlohmann::ordered_json further) {
  if (session.options().format == Format::Json) {
    nlohmann::ordered_json content = {{"wwpn", wwpn}, {"result", result}, {"words", said}};
    content.update(further);
    printJson(session, member, std::move(content));
  } else {
    session.out() << fmt::format("{}: {} ({})\n", wwpn, said, result);
  }
  return result == 0 ? ExitCode::Ok : ExitCode::MethodResult;
}

}  // namespace tvx::host
