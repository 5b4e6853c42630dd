#include "runtime/Conversions.h"

#include <locale.h>
#include <strings.h>

#include <array>
#include <cfloat>
#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <limits>

namespace cimrt {
namespace {

constexpr std::size_t MAX_DECIMAL_DIGITS = 20;
constexpr std::size_t MAX_HEX_DIGITS = 16;

/// Value of each byte as a hexadecimal digit, upper case only; -1 for everything else.
constexpr std::array<std::int8_t, 256> digit_values = [] {
  std::array<std::int8_t, 256> values{};
  values.fill(-1);
  for (std::size_t i = 0; i < 10; ++i) values[std::size_t{'0'} + i] = static_cast<std::int8_t>(i);
  for (std::size_t i = 0; i < 6; ++i)
    values[std::size_t{'A'} + i] = static_cast<std::int8_t>(10 + i);
  return values;
}();

/// Value of a digit of `base`, or -1.
int digit(char c, int base = 10) {
  const int value{digit_values[static_cast<unsigned char>(
      c)]};  // NOLINT(bugprone-signed-char-misuse): -1 is meant
  return value < base ? value : -1;
}

/// Decimal digits up to the NUL, summed without an overflow check; for texts of three and more.
int read_long_decimal(const char* text, std::uint64_t& out) {
  std::uint64_t value = 0;
  for (std::size_t i = 0; text[i] != '\0'; ++i) {
    const int d = digit(text[i]);
    if (d < 0 || i == MAX_DECIMAL_DIGITS) return -1;
    value = value * 10 + static_cast<std::uint64_t>(d);
  }
  out = value;
  return 0;
}

/// Digits of `base` read from the right; a sum beyond 64 bits is refused.
int read_from_right(const char* text, std::size_t n, std::uint64_t base, std::uint64_t& out) {
  std::uint64_t value = 0;
  std::uint64_t factor = 1;
  for (std::size_t i = n; i > 0; --i) {
    const int d = digit(text[i - 1], static_cast<int>(base));
    std::uint64_t product = 0;
    if (d < 0 || __builtin_mul_overflow(factor, static_cast<std::uint64_t>(d), &product) ||
        __builtin_add_overflow(value, product, &value))
      return -1;
    factor *= base;
  }
  out = value;
  return 0;
}

bool starts_with_three_digits(const char* text) {
  return digit(text[0]) >= 0 && digit(text[1]) >= 0 && digit(text[2]) >= 0;
}

int read_hexadecimal(const char* text, std::uint64_t& out) {
  if (text[0] != '0' || (text[1] != 'x' && text[1] != 'X')) return -1;
  const std::size_t n = strnlen(text + 2, MAX_HEX_DIGITS + 1);
  if (n == 0 || n > MAX_HEX_DIGITS) return -1;
  return read_from_right(text + 2, n, 16, out);
}

template <class T>
int read_unsigned(const char* text, T& out) {
  std::uint64_t value = 0;
  if (str_to_uint64(text, value) != 0 || value > std::numeric_limits<T>::max()) return -1;
  out = static_cast<T>(value);
  return 0;
}

template <class T>
int read_signed(const char* text, T& out) {
  std::int64_t value = 0;
  if (str_to_sint64(text, value) != 0) return -1;
  if (value < std::numeric_limits<T>::min() || value > std::numeric_limits<T>::max()) return -1;
  out = static_cast<T>(value);
  return 0;
}

const char* skip_sign(const char* p) {
  return *p == '+' || *p == '-' ? p + 1 : p;
}

const char* skip_digits(const char* p) {
  while (digit(*p) >= 0) ++p;
  return p;
}

/// Sign, digits, '.', digits, exponent: only the '.' and a digit behind it are a must.
bool is_real(const char* text) {
  const char* p = skip_digits(skip_sign(text));
  if (*p != '.' || digit(p[1]) < 0) return false;
  p = skip_digits(p + 1);
  if (*p == 'e' || *p == 'E') {
    p = skip_sign(p + 1);
    if (digit(*p) < 0) return false;
    p = skip_digits(p);
  }
  return *p == '\0';
}

/// The "C" locale: the decimal separator of a CIM real is always '.'.
locale_t c_locale() {
  static const locale_t locale = newlocale(LC_ALL_MASK, "C", nullptr);
  return locale;
}

struct Small_Number {
  char text[4];
  std::uint32_t size;
};

/// Texts of 0 to 127.
constexpr std::array<Small_Number, 128> small_numbers = [] {
  std::array<Small_Number, 128> table{};
  for (unsigned i = 0; i < table.size(); ++i) {
    Small_Number& entry = table[i];
    if (i >= 100) entry.text[entry.size++] = static_cast<char>('0' + i / 100);
    if (i >= 10) entry.text[entry.size++] = static_cast<char>('0' + i / 10 % 10);
    entry.text[entry.size++] = static_cast<char>('0' + i % 10);
  }
  return table;
}();

const char* write_number(char (&buffer)[NUMBER_TEXT_SIZE], std::uint64_t magnitude, bool negative,
                         std::size_t& size) {
  if (!negative && magnitude < small_numbers.size()) {
    size = small_numbers[magnitude].size;
    return small_numbers[magnitude].text;
  }
  char* const end = buffer + NUMBER_TEXT_SIZE - 1;
  char* p = end;
  *p = '\0';
  for (; magnitude != 0; magnitude /= 10) *--p = static_cast<char>('0' + magnitude % 10);
  if (negative) *--p = '-';
  size = static_cast<std::size_t>(end - p);
  return p;
}

const char* write_signed(char (&buffer)[NUMBER_TEXT_SIZE], std::int64_t x, std::size_t& size) {
  const auto bits = static_cast<std::uint64_t>(x);
  return write_number(buffer, x < 0 ? 0 - bits : bits, x < 0, size);
}

}  // namespace

int str_to_boolean(const char* text, bool& out) {
  const bool is_true = strcasecmp(text, "true") == 0;
  if (!is_true && strcasecmp(text, "false") != 0) return -1;
  out = is_true;
  return 0;
}

int str_to_uint64(const char* text, std::uint64_t& out) {
  if (starts_with_three_digits(text)) return read_long_decimal(text, out);
  const std::size_t n = std::strlen(text);
  if (n != 0 && read_from_right(text, n, 10, out) == 0) return 0;
  return read_hexadecimal(text, out);
}

int str_to_uint8(const char* text, std::uint8_t& out) {
  return read_unsigned(text, out);
}

int str_to_uint16(const char* text, std::uint16_t& out) {
  return read_unsigned(text, out);
}

int str_to_uint32(const char* text, std::uint32_t& out) {
  return read_unsigned(text, out);
}

int str_to_sint64(const char* text, std::int64_t& out) {
  constexpr std::uint64_t max = std::numeric_limits<std::int64_t>::max();
  const bool negative = *text == '-';
  std::uint64_t magnitude = 0;
  if (str_to_uint64(skip_sign(text), magnitude) != 0) return -1;
  if (magnitude > (negative ? max + 1 : max)) return -1;
  out = static_cast<std::int64_t>(negative ? 0 - magnitude : magnitude);
  return 0;
}

int str_to_sint8(const char* text, std::int8_t& out) {
  return read_signed(text, out);
}

int str_to_sint16(const char* text, std::int16_t& out) {
  return read_signed(text, out);
}

int str_to_sint32(const char* text, std::int32_t& out) {
  return read_signed(text, out);
}

int str_to_real64(const char* text, double& out) {
  if (!is_real(text)) return -1;
  char* end = nullptr;
  const double value = strtod_l(text, &end, c_locale());
  if (*end != '\0') return -1;
  out = value;
  return 0;
}

int str_to_real32(const char* text, float& out) {
  double value = 0;
  if (str_to_real64(text, value) != 0) return -1;
  constexpr double max = FLT_MAX;
  out = std::fabs(value) <= max ? static_cast<float>(value)
                                : std::copysign(HUGE_VALF, value < 0 ? -1.0f : 1.0f);
  return 0;
}

int str_to_type(const char* name, Type& out) {
  for (std::size_t i = 0; i < NUM_TYPES; ++i) {
    if (!name_eq(type_name_table[i], name)) continue;
    out = static_cast<Type>(i);
    return 0;
  }
  return -1;
}

const char* uint8_to_str(char (&buffer)[NUMBER_TEXT_SIZE], std::uint8_t x, std::size_t& size) {
  return write_number(buffer, x, false, size);
}

const char* uint16_to_str(char (&buffer)[NUMBER_TEXT_SIZE], std::uint16_t x, std::size_t& size) {
  return write_number(buffer, x, false, size);
}

const char* uint32_to_str(char (&buffer)[NUMBER_TEXT_SIZE], std::uint32_t x, std::size_t& size) {
  return write_number(buffer, x, false, size);
}

const char* uint64_to_str(char (&buffer)[NUMBER_TEXT_SIZE], std::uint64_t x, std::size_t& size) {
  return write_number(buffer, x, false, size);
}

const char* sint8_to_str(char (&buffer)[NUMBER_TEXT_SIZE], std::int8_t x, std::size_t& size) {
  return write_signed(buffer, x, size);
}

const char* sint16_to_str(char (&buffer)[NUMBER_TEXT_SIZE], std::int16_t x, std::size_t& size) {
  return write_signed(buffer, x, size);
}

const char* sint32_to_str(char (&buffer)[NUMBER_TEXT_SIZE], std::int32_t x, std::size_t& size) {
  return write_signed(buffer, x, size);
}

const char* sint64_to_str(char (&buffer)[NUMBER_TEXT_SIZE], std::int64_t x, std::size_t& size) {
  return write_signed(buffer, x, size);
}

std::size_t str_lcpy(char* dest, const char* src, std::size_t size) {
  const std::size_t wanted = std::strlen(src);
  if (size == 0) return wanted;
  const std::size_t n = wanted < size ? wanted : size - 1;
  std::memcpy(dest, src, n);
  dest[n] = '\0';
  return wanted;
}

std::size_t str_lcat(char* dest, const char* src, std::size_t size) {
  const std::size_t used = strnlen(dest, size);
  return used + str_lcpy(dest + used, src, size - used);
}

char* format_alloc(const char* fmt, ...) {
  va_list args;
  va_start(args, fmt);
  char* text = vformat_alloc(fmt, args);
  va_end(args);
  return text;
}

char* vformat_alloc(const char* fmt, va_list args) {
  char* text = nullptr;
  return vasprintf(&text, fmt, args) < 0 ? nullptr : text;
}

}  // namespace cimrt
