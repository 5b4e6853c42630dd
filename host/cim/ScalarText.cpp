#include "cim/ScalarText.h"

#include <charconv>

#include "cim/DateTimeText.h"

namespace tvx::host {
namespace {

std::optional<Value> booleanFromText(const std::string& text) {
  const bool isTrue = sameName(text, "true") || text == "1";
  if (!isTrue && !sameName(text, "false") && text != "0") {
    return std::nullopt;
  }
  return Value::boolean(isTrue);
}

std::optional<Value> realFromText(CMPIType type, const std::string& text) {
  double value = 0;
  const char* end = text.data() + text.size();
  const auto result = std::from_chars(text.data(), end, value);
  if (text.empty() || result.ptr != end || result.ec != std::errc()) {
    return std::nullopt;
  }
  return Value::real(type, value);
}

std::optional<Value> unsignedInRange(CMPIType type, std::uint64_t magnitude, bool negative) {
  Value value = Value::number(type, magnitude);
  if (negative || value.asUnsigned() != magnitude) {
    return std::nullopt;
  }
  return value;
}

std::optional<Value> signedInRange(CMPIType type, std::uint64_t magnitude, bool negative) {
  constexpr auto limit = static_cast<std::uint64_t>(INT64_MAX);
  if (magnitude > limit + (negative ? 1 : 0)) {
    return std::nullopt;
  }
  const auto wide = static_cast<std::int64_t>(negative ? 0 - magnitude : magnitude);
  Value value = Value::signedNumber(type, wide);
  if (value.asSigned() != wide) {
    return std::nullopt;
  }
  return value;
}

std::optional<Value> integerFromText(CMPIType type, const std::string& text) {
  const bool negative = text.starts_with('-');
  const std::string digits = text.substr(negative ? 1 : 0);
  const bool hex = digits.starts_with("0x") || digits.starts_with("0X");
  const char* start = digits.data() + (hex ? 2 : 0);
  const char* end = digits.data() + digits.size();
  std::uint64_t magnitude = 0;
  const auto result = std::from_chars(start, end, magnitude, hex ? 16 : 10);
  if (start == end || result.ptr != end || result.ec != std::errc()) {
    return std::nullopt;
  }
  return type < CMPI_SINT ? unsignedInRange(type, magnitude, negative)
                          : signedInRange(type, magnitude, negative);
}

bool isOneCharacter(const std::string& text) {
  return text.size() == 1 && (text[0] < '0' || text[0] > '9');
}

}  // namespace

std::optional<Value> scalarFromText(CMPIType type, const std::string& text) {
  switch (type) {
    case CMPI_string:
      return Value::string(text);
    case CMPI_boolean:
      return booleanFromText(text);
    case CMPI_dateTime:
      return isDateTimeText(text) ? std::optional(Value::dateTime(text)) : std::nullopt;
    case CMPI_real32:
    case CMPI_real64:
      return realFromText(type, text);
    case CMPI_char16:
      return isOneCharacter(text) ? Value::number(type, static_cast<unsigned char>(text[0]))
                                  : integerFromText(type, text);
    default:
      return integerFromText(type, text);
  }
}

std::string fittingText(CMPIType type) {
  struct Row {
    CMPIType type;
    const char* text;
  };
  static constexpr Row rows[] = {
      {CMPI_boolean, "true or false"},
      {CMPI_uint8, "a number from 0 to 255"},
      {CMPI_uint16, "a number from 0 to 65535"},
      {CMPI_uint32, "a number from 0 to 4294967295"},
      {CMPI_uint64, "a number from 0 to 18446744073709551615"},
      {CMPI_sint8, "a number from -128 to 127"},
      {CMPI_sint16, "a number from -32768 to 32767"},
      {CMPI_sint32, "a number from -2147483648 to 2147483647"},
      {CMPI_sint64, "a number from -9223372036854775808 to 9223372036854775807"},
      {CMPI_real32, "a number such as 1.5 or -2e3"},
      {CMPI_real64, "a number such as 1.5 or -2e3"},
      {CMPI_char16, "one character or its number"},
      {CMPI_dateTime, "a time as 20240229235959.000000+060 or a span as 00000001020304.000000:000"},
  };
  for (const Row& row : rows) {
    if (row.type == type) {
      return row.text;
    }
  }
  return "a text";
}

}  // namespace tvx::host
