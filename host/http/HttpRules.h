// What CIM operations over HTTP ask of the head of a request.
#pragma once

#include <cstddef>
#include <map>
#include <optional>
#include <string>
#include <string_view>

#include "http/CimMessage.h"

namespace tvx::host::http {

/// Head of an HTTP request.
struct HttpHead {
  std::string method;
  std::string path;
  std::map<std::string, std::string> fields;  ///< by name in lower case

  /// The field, trimmed, or nothing. `name` is in lower case.
  std::optional<std::string> field(const std::string& name) const;
  /// A field of CIM: of an M-POST request it has the prefix that its Man field declares.
  std::optional<std::string> cimField(const std::string& name) const;
};

/// Throws MessageError for a head that no body can make good: 405 for other methods than POST and
/// M-POST, 404 for other paths than /cimom, 411 without a length, 413 for a length over
/// `bodyLimit`, 400 for a length that is none, 415 for other contents than XML, 400 or 501 for the
/// fields of CIM.
void checkHead(const HttpHead& head, std::size_t bodyLimit);

/// Throws MessageError (header-mismatch) if the fields tell another method or namespace than the
/// message does.
void checkAgainst(const HttpHead& head, const CimMessage& message);

/// The Host field if it looks like a host name or address, with or without port; else this
/// machine's name.
std::string hostOf(const HttpHead& head);

}  // namespace tvx::host::http
