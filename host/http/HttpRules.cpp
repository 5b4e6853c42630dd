#include "http/HttpRules.h"

#include <fmt/format.h>
#include <unistd.h>

#include <algorithm>
#include <charconv>

#include "cim/Value.h"
#include "http/CimErrors.h"
#include "http/XmlText.h"

namespace tvx::host::http {
namespace {

constexpr std::string_view postMethods[] = {"POST", "M-POST"};
constexpr std::string_view contentTypes[] = {"application/xml", "text/xml"};

[[noreturn]] void refuse(unsigned status, const std::string& text, const char* cimError = "") {
  throw MessageError(status, cimError, text);
}

void checkMethod(const HttpHead& head) {
  if (std::find(std::begin(postMethods), std::end(postMethods), head.method) ==
      std::end(postMethods)) {
    refuse(405, "only POST and M-POST are served");
  }
  if (head.path != "/cimom") {
    refuse(404, "the path of the server is /cimom");
  }
}

void checkContentType(const HttpHead& head) {
  const std::string type = head.field("content-type").value_or("");
  const std::string_view media = trimmed(std::string_view(type).substr(0, type.find(';')));
  const bool known = std::any_of(std::begin(contentTypes), std::end(contentTypes),
                                 [&](std::string_view each) { return sameName(each, media); });
  if (!known) {
    refuse(415, "the content has to be application/xml or text/xml");
  }
}

void checkLength(const HttpHead& head, std::size_t bodyLimit) {
  const std::optional<std::string> length = head.field("content-length");
  if (!length) {
    if (!head.field("transfer-encoding")) {
      refuse(411, "the length of the content is missing");
    }
    return;
  }
  if (head.field("transfer-encoding")) {
    refuse(400, "the content has both a length and a transfer encoding");
  }
  std::size_t bytes = 0;
  const char* end = length->data() + length->size();
  const auto result = std::from_chars(length->data(), end, bytes);
  const bool isNumber = result.ptr == end && !length->empty();
  if (result.ec == std::errc::result_out_of_range || (isNumber && bytes > bodyLimit)) {
    refuse(413, fmt::format("the content is larger than {} bytes", bodyLimit));
  }
  if (!isNumber) {
    refuse(400, "the length of the content is no number");
  }
}

void checkCimFields(const HttpHead& head) {
  const std::optional<std::string> operation = head.cimField("cimoperation");
  if (!operation) {
    refuse(400, "the header field CIMOperation is missing", "request-not-valid");
  }
  if (!sameName(*operation, "MethodCall")) {
    refuse(501, "only CIMOperation: MethodCall is served", "unsupported-operation");
  }
  const std::optional<std::string> version = head.cimField("cimprotocolversion");
  if (version && !version->starts_with("1.")) {
    refuse(501, "only CIMProtocolVersion 1 is served", "unsupported-protocol-version");
  }
}

bool isHostText(std::string_view text) {
  return !text.empty() && text.size() <= 255 && std::all_of(text.begin(), text.end(), [](char c) {
    return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9') || c == '.' ||
           c == '-' || c == ':' || c == '[' || c == ']' || c == '_';
  });
}

std::string machineName() {
  char name[256] = {};
  return gethostname(name, sizeof name - 1) == 0 && name[0] != '\0' ? name : "localhost";
}

}  // namespace

std::optional<std::string> HttpHead::field(const std::string& name) const {
  const auto found = fields.find(name);
  return found == fields.end() ? std::nullopt : std::optional(std::string(trimmed(found->second)));
}

std::optional<std::string> HttpHead::cimField(const std::string& name) const {
  if (method != "M-POST") {
    return field(name);
  }
  const std::string man = field("man").value_or("");
  const std::size_t start = man.find("ns=");
  if (start == std::string::npos) {
    return std::nullopt;
  }
  const std::string number = man.substr(start + 3, man.find_first_of("; ,", start) - start - 3);
  return field(number + "-" + name);
}

void checkHead(const HttpHead& head, std::size_t bodyLimit) {
  checkMethod(head);
  checkLength(head, bodyLimit);
  checkContentType(head);
  checkCimFields(head);
}

void checkAgainst(const HttpHead& head, const CimMessage& message) {
  const std::optional<std::string> method = head.cimField("cimmethod");
  if (method && !sameName(percentDecoded(*method), message.name())) {
    refuse(400, "CIMMethod is not the method of the message", "header-mismatch");
  }
  const std::optional<std::string> object = head.cimField("cimobject");
  if (object && message.isIntrinsic() && !sameName(percentDecoded(*object), message.nameSpace())) {
    refuse(400, "CIMObject is not the namespace of the message", "header-mismatch");
  }
}

std::string hostOf(const HttpHead& head) {
  const std::string host = head.field("host").value_or("");
  return isHostText(host) ? host : machineName();
}

}  // namespace tvx::host::http
