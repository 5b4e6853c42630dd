// Texts to numbers and back, bounded copies and formatted texts on the heap.
#pragma once

#include <cstdarg>
#include <cstddef>
#include <cstdint>

#include "runtime/Types.h"

namespace cimrt {

/// Readers: 0 with the value in `out`, or -1 with `out` untouched when the text is refused. A text
/// is never null and is read as a whole: no surrounding spaces. Unsigned numbers are decimal, or
/// hexadecimal behind "0x" with upper-case digits; signed ones may have one leading sign. Decimal
/// texts of 20 digits are not checked for overflow of 64 bits.
int str_to_boolean(const char* text, bool& out);  ///< "true" and "false" in any case
int str_to_uint8(const char* text, std::uint8_t& out);
int str_to_uint16(const char* text, std::uint16_t& out);
int str_to_uint32(const char* text, std::uint32_t& out);
int str_to_uint64(const char* text, std::uint64_t& out);
int str_to_sint8(const char* text, std::int8_t& out);
int str_to_sint16(const char* text, std::int16_t& out);
int str_to_sint32(const char* text, std::int32_t& out);
int str_to_sint64(const char* text, std::int64_t& out);
/// Reals need a '.' with a digit behind it; the exponent is optional. The locale does not matter.
int str_to_real32(const char* text, float& out);
int str_to_real64(const char* text, double& out);
/// `Type` code of a MOF type name, in any case.
int str_to_type(const char* name, Type& out);

/// Room that the writers need.
inline constexpr std::size_t NUMBER_TEXT_SIZE = 22;

/// Writers: the decimal text, NUL-terminated, and its length in `size`. The answer points into
/// `buffer` or, for 0 to 127, at a constant.
const char* uint8_to_str(char (&buffer)[NUMBER_TEXT_SIZE], std::uint8_t x, std::size_t& size);
const char* uint16_to_str(char (&buffer)[NUMBER_TEXT_SIZE], std::uint16_t x, std::size_t& size);
const char* uint32_to_str(char (&buffer)[NUMBER_TEXT_SIZE], std::uint32_t x, std::size_t& size);
const char* uint64_to_str(char (&buffer)[NUMBER_TEXT_SIZE], std::uint64_t x, std::size_t& size);
const char* sint8_to_str(char (&buffer)[NUMBER_TEXT_SIZE], std::int8_t x, std::size_t& size);
const char* sint16_to_str(char (&buffer)[NUMBER_TEXT_SIZE], std::int16_t x, std::size_t& size);
const char* sint32_to_str(char (&buffer)[NUMBER_TEXT_SIZE], std::int32_t x, std::size_t& size);
const char* sint64_to_str(char (&buffer)[NUMBER_TEXT_SIZE], std::int64_t x, std::size_t& size);

/// Bounded copy and append into a place of `size` bytes, always NUL-terminated unless `size` is 0.
/// They answer the length that was wanted: at or above `size` means that the text was cut. Named
/// apart from the C library's, which not every version has.
std::size_t str_lcpy(char* dest, const char* src, std::size_t size);
std::size_t str_lcat(char* dest, const char* src, std::size_t size);

/// printf-style text in a block that the caller frees with `free`; null if it cannot be formatted.
char* format_alloc(const char* fmt, ...) __attribute__((format(printf, 1, 2)));
char* vformat_alloc(const char* fmt, va_list args) __attribute__((format(printf, 1, 0)));

}  // namespace cimrt
