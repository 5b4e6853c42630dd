#include "http/XmlText.h"

#include <cstddef>
#include <cstdint>

namespace tvx::host::http {
namespace {

constexpr std::string_view replacement = "\xEF\xBF\xBD";

/// Length of the sequence that starts with `lead`, 0 if none can.
std::size_t sequenceLength(unsigned char lead) {
  if (lead < 0x80) {
    return 1;
  }
  if (lead >= 0xC2 && lead <= 0xDF) {
    return 2;
  }
  if (lead >= 0xE0 && lead <= 0xEF) {
    return 3;
  }
  return lead >= 0xF0 && lead <= 0xF4 ? 4 : 0;
}

bool isXmlCharacter(std::uint32_t c) {
  if (c < 0x20) {
    return c == '\t' || c == '\n' || c == '\r';
  }
  const bool surrogate = c >= 0xD800 && c <= 0xDFFF;
  return !surrogate && c != 0xFFFE && c != 0xFFFF && c <= 0x10FFFF;
}

/// Length of the XML character at the front of `bytes`, 0 if there is none.
std::size_t characterLength(std::string_view bytes) {
  constexpr std::uint32_t leadMasks[] = {0, 0x7F, 0x1F, 0x0F, 0x07};
  constexpr std::uint32_t smallest[] = {0, 0, 0x80, 0x800, 0x10000};
  const auto lead = static_cast<unsigned char>(bytes[0]);
  const std::size_t length = sequenceLength(lead);
  if (length == 0 || length > bytes.size()) {
    return 0;
  }
  std::uint32_t c = lead & leadMasks[length];
  for (std::size_t i = 1; i < length; ++i) {
    const auto next = static_cast<unsigned char>(bytes[i]);
    if ((next & 0xC0) != 0x80) {
      return 0;
    }
    c = (c << 6) | (next & 0x3Fu);
  }
  return c >= smallest[length] && isXmlCharacter(c) ? length : 0;
}

std::string_view entityOf(char c) {
  switch (c) {
    case '&':
      return "&amp;";
    case '<':
      return "&lt;";
    case '>':
      return "&gt;";
    case '"':
      return "&quot;";
    case '\r':
      return "&#13;";
    case '\n':
      return "&#10;";
    case '\t':
      return "&#9;";
    default:
      return {};
  }
}

int hexDigit(char c) {
  if (c >= '0' && c <= '9') {
    return c - '0';
  }
  if (c >= 'a' && c <= 'f') {
    return c - 'a' + 10;
  }
  return c >= 'A' && c <= 'F' ? c - 'A' + 10 : -1;
}

}  // namespace

bool isXmlText(std::string_view bytes) {
  while (!bytes.empty()) {
    const std::size_t length = characterLength(bytes);
    if (length == 0) {
      return false;
    }
    bytes.remove_prefix(length);
  }
  return true;
}

void appendEscaped(std::string& out, std::string_view text) {
  while (!text.empty()) {
    const std::size_t length = characterLength(text);
    const std::string_view entity = entityOf(text[0]);
    if (length == 0) {
      out += replacement;
    } else if (!entity.empty()) {
      out += entity;
    } else {
      out += text.substr(0, length);
    }
    text.remove_prefix(length == 0 ? 1 : length);
  }
}

void appendAttribute(std::string& out, std::string_view name, std::string_view value) {
  out += ' ';
  out += name;
  out += "=\"";
  appendEscaped(out, value);
  out += '"';
}

std::string percentDecoded(std::string_view text) {
  std::string result;
  for (std::size_t i = 0; i < text.size(); ++i) {
    if (text[i] == '%' && i + 2 < text.size() && hexDigit(text[i + 1]) >= 0 &&
        hexDigit(text[i + 2]) >= 0) {
      result += static_cast<char>(hexDigit(text[i + 1]) * 16 + hexDigit(text[i + 2]));
      i += 2;
    } else {
      result += text[i];
    }
  }
  return result;
}

std::string percentEncoded(std::string_view text) {
  constexpr std::string_view plain =
      "abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ0123456789-._~ /:,";
  constexpr char digits[] = "0123456789ABCDEF";
  std::string result;
  for (const char c : text) {
    if (plain.find(c) != std::string_view::npos) {
      result += c;
      continue;
    }
    const auto byte = static_cast<unsigned char>(c);
    result += {'%', digits[byte >> 4], digits[byte & 0xF]};
  }
  return result;
}

std::string_view trimmed(std::string_view text) {
  constexpr std::string_view blanks = " \t\r\n";
  const std::size_t start = text.find_first_not_of(blanks);
  if (start == std::string_view::npos) {
    return {};
  }
  return text.substr(start, text.find_last_not_of(blanks) - start + 1);
}

}  // namespace tvx::host::http
