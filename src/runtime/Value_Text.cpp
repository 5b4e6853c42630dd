// Texts of single values on a stream.
#include <cinttypes>

#include "runtime/Value.h"

namespace cimrt {
namespace {

template <class T>
const T& at(const void* p) {
  return *static_cast<const T*>(p);
}

/// Letter that stands behind a backslash for a character, or NUL for a character that stands alone.
char escape_letter(char c) {
  switch (c) {
    case '\t':
      return 't';
    case '\n':
      return 'n';
    case '\r':
      return 'r';
    case '\f':
      return 'f';
    case '"':
    case '\\':
      return c;
    default:
      return '\0';
  }
}

void write_string(std::FILE* stream, const String& text) {
  std::fputc('"', stream);
  for (const char c : text.view()) {
    const char letter = escape_letter(c);
    if (letter != '\0') std::fputc('\\', stream);
    std::fputc(letter != '\0' ? letter : c, stream);
  }
  std::fputc('"', stream);
}

void write_unsigned(std::FILE* stream, Type type, const void* value) {
  switch (type) {
    case UINT8:
      std::fprintf(stream, "%u", unsigned{at<std::uint8_t>(value)});
      break;
    case UINT16:
      std::fprintf(stream, "%u", unsigned{at<std::uint16_t>(value)});
      break;
    case UINT32:
      std::fprintf(stream, "%u", at<std::uint32_t>(value));
      break;
    case CHAR16:
      std::fprintf(stream, "%u", unsigned{at<char16_t>(value)});
      break;
    default:
      std::fprintf(stream, "%" PRIu64, at<std::uint64_t>(value));
      break;
  }
}

void write_signed(std::FILE* stream, Type type, const void* value) {
  switch (type) {
    case SINT8:
      std::fprintf(stream, "%d", int{at<std::int8_t>(value)});
      break;
    case SINT16:
      std::fprintf(stream, "%d", int{at<std::int16_t>(value)});
      break;
    case SINT32:
      std::fprintf(stream, "%d", at<std::int32_t>(value));
      break;
    default:
      std::fprintf(stream, "%" PRId64, at<std::int64_t>(value));
      break;
  }
}

}  // namespace

void write_scalar(std::FILE* stream, Type type, const void* value) {
  switch (type) {
    case BOOLEAN:
      std::fputs(at<std::uint8_t>(value) != 0 ? "true" : "false", stream);
      break;
    case UINT8:
    case UINT16:
    case UINT32:
    case UINT64:
    case CHAR16:
      write_unsigned(stream, type, value);
      break;
    case SINT8:
    case SINT16:
    case SINT32:
    case SINT64:
      write_signed(stream, type, value);
      break;
    case REAL32:
      std::fprintf(stream, "%f", static_cast<double>(at<float>(value)));
      break;
    case REAL64:
      std::fprintf(stream, "%f", at<double>(value));
      break;
    case STRING:
      write_string(stream, at<String>(value));
      break;
    case DATETIME:
      at<Datetime>(value).print(stream, false);
      break;
    default:
      break;
  }
}

void write_array(std::FILE* stream, Type type, const Array_Base& array) {
  for (std::size_t i = 0; i < array.size(); ++i) {
    if (i != 0) std::fputs(", ", stream);
    write_scalar(stream, type, array.element(i));
  }
}

}  // namespace cimrt
