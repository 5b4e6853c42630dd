// Texts between C++ and XML.
#pragma once

#include <string>
#include <string_view>

namespace tvx::host::http {

/// True if the bytes are UTF-8 made of characters that an XML 1.0 document may hold.
bool isXmlText(std::string_view bytes);

/// Appends `text` so that an element or attribute that holds it reads as the same text. Bytes and
/// characters that XML cannot hold become U+FFFD.
void appendEscaped(std::string& out, std::string_view text);

/// Appends ` name="value"`.
void appendAttribute(std::string& out, std::string_view name, std::string_view value);

/// Reads %xx sequences; a broken one stays as it stands.
std::string percentDecoded(std::string_view text);

/// Writes every character outside of letters, digits and "-._~ /:," as %xx, for header fields.
std::string percentEncoded(std::string_view text);

/// Without white space at both ends.
std::string_view trimmed(std::string_view text);

}  // namespace tvx::host::http
