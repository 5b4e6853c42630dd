#include "runtime/Datetime.h"

#include <sys/time.h>

#include <cstdlib>
#include <cstring>
#include <ctime>

namespace cimrt {
namespace {

constexpr std::uint64_t SECOND = 1000000;
constexpr std::uint64_t MINUTE = 60 * SECOND;
constexpr std::uint64_t HOUR = 60 * MINUTE;
constexpr std::uint64_t DAY = 24 * HOUR;

constexpr std::size_t TEXT_LENGTH = 25;
constexpr std::size_t DOT = 14;
constexpr std::size_t KIND = 21;

DatetimeRep* make(std::uint64_t usec, std::int32_t utc, std::int32_t is_timestamp) {
  return new DatetimeRep{1, usec, utc, is_timestamp};
}

/// Reads `width` digits from the right; a width of 0 reads as 0.
bool read_digits(const char* text, std::size_t width, std::uint32_t& out) {
  std::uint32_t value = 0;
  std::uint32_t factor = 1;
  for (std::size_t i = width; i > 0; --i) {
    const char c = text[i - 1];
    if (c < '0' || c > '9') return false;
    value += factor * static_cast<std::uint32_t>(c - '0');
    factor *= 10;
  }
  out = value;
  return true;
}

struct Field {
  std::size_t pos;
  std::size_t width;
};

/// Reads one number per field; false at the first that holds a non-digit.
template <std::size_t N>
bool read_fields(const char* text, const Field (&fields)[N], std::uint32_t (&out)[N]) {
  for (std::size_t i = 0; i < N; ++i)
    if (!read_digits(text + fields[i].pos, fields[i].width, out[i])) return false;
  return true;
}

// days, hours, minutes, seconds, microseconds, the zeros behind the ':'
constexpr Field interval_fields[] = {{0, 8}, {8, 2}, {10, 2}, {12, 2}, {15, 6}};
// year, month, day, hours, minutes, seconds, microseconds, offset from UTC in minutes
constexpr Field timestamp_fields[] = {{0, 4},  {4, 2},  {6, 2},  {8, 2},
                                      {10, 2}, {12, 2}, {15, 6}, {22, 3}};

/// Microseconds since the epoch of a broken-down local time. No field is range-checked.
std::uint64_t local_usec(const std::uint32_t (&f)[6], std::uint32_t microseconds) {
  std::tm tm = {};
  tm.tm_year = static_cast<int>(f[0]) - 1900;
  tm.tm_mon = static_cast<int>(f[1]) - 1;
  tm.tm_mday = static_cast<int>(f[2]);
  tm.tm_hour = static_cast<int>(f[3]);
  tm.tm_min = static_cast<int>(f[4]);
  tm.tm_sec = static_cast<int>(f[5]);
  tm.tm_isdst = -1;
  return static_cast<std::uint64_t>(std::mktime(&tm)) * SECOND + microseconds;
}

}  // namespace

Datetime::Datetime() : _rep(make(0, 0, 0)) {}

Datetime::Datetime(std::uint64_t usec) : _rep(make(usec, 0, 0)) {}

Datetime::Datetime(std::uint64_t usec, std::int32_t utc) : _rep(make(usec, utc, 1)) {}

Datetime::Datetime(const char* text) : Datetime() {
  set(text);
}

Datetime::Datetime(const Datetime& other) noexcept : _rep(other._rep) {
  _rep->refs.fetch_add(1, std::memory_order_relaxed);
}

Datetime::~Datetime() {
  release(_rep);
}

// NOLINTNEXTLINE(bugprone-unhandled-self-assignment): taking before dropping is safe on itself too
Datetime& Datetime::operator=(const Datetime& other) noexcept {
  DatetimeRep* old = _rep;
  other._rep->refs.fetch_add(1, std::memory_order_relaxed);
  _rep = other._rep;
  release(old);
  return *this;
}

void Datetime::release(DatetimeRep* rep) noexcept {
  if (rep->refs.fetch_sub(1, std::memory_order_acq_rel) == 1) delete rep;
}

void Datetime::make_private() {
  if (_rep->refs.load(std::memory_order_acquire) == 1) return;
  DatetimeRep* old = _rep;
  _rep = make(old->usec, old->utc, old->is_timestamp);
  release(old);
}

void Datetime::store(std::uint64_t usec, std::int32_t utc, std::int32_t is_timestamp) {
  make_private();
  _rep->usec = usec;
  _rep->utc = utc;
  _rep->is_timestamp = is_timestamp;
}

Datetime Datetime::now() {
  timeval tv = {};
  struct timezone tz = {};
  if (gettimeofday(&tv, &tz) != 0) return Datetime();
  return Datetime(
      static_cast<std::uint64_t>(tv.tv_sec) * SECOND + static_cast<std::uint64_t>(tv.tv_usec),
      -tz.tz_minuteswest);
}

bool Datetime::set(const char* text) {
  make_private();
  if (!text || strnlen(text, TEXT_LENGTH + 1) != TEXT_LENGTH || text[DOT] != '.') return false;
  switch (text[KIND]) {
    case ':':
      return set_interval_text(text);
    case '+':
    case '-':
      return set_timestamp_text(text);
    default:
      return false;
  }
}

bool Datetime::set_interval_text(const char* text) {
  std::uint32_t f[std::size(interval_fields)];
  if (!read_fields(text, interval_fields, f)) return false;
  if (std::memcmp(text + KIND + 1, "000", 3) != 0) return false;
  set_interval(f[0], f[1], f[2], f[3], f[4]);
  return true;
}

bool Datetime::set_timestamp_text(const char* text) {
  std::uint32_t f[std::size(timestamp_fields)];
  if (!read_fields(text, timestamp_fields, f)) return false;
  const auto offset = static_cast<std::int32_t>(f[7]);
  set_timestamp(f[0], f[1], f[2], f[3], f[4], f[5], f[6], text[KIND] == '-' ? -offset : offset);
  return true;
}

void Datetime::set_interval(std::uint32_t days, std::uint32_t hours, std::uint32_t minutes,
                            std::uint32_t seconds, std::uint32_t microseconds) {
  store(days * DAY + hours * HOUR + minutes * MINUTE + seconds * SECOND + microseconds, 0, 0);
}

void Datetime::set_timestamp(std::uint32_t year, std::uint32_t month, std::uint32_t day,
                             std::uint32_t hours, std::uint32_t minutes, std::uint32_t seconds,
                             std::uint32_t microseconds, std::int32_t utc) {
  store(local_usec({year, month, day, hours, minutes, seconds}, microseconds), utc, 1);
}

void Datetime::get_interval(std::uint32_t& days, std::uint32_t& hours, std::uint32_t& minutes,
                            std::uint32_t& seconds, std::uint32_t& microseconds) const {
  const std::uint64_t value = usec();
  days = static_cast<std::uint32_t>(value / DAY);
  hours = static_cast<std::uint32_t>(value % DAY / HOUR);
  minutes = static_cast<std::uint32_t>(value % HOUR / MINUTE);
  seconds = static_cast<std::uint32_t>(value % MINUTE / SECOND);
  microseconds = static_cast<std::uint32_t>(value % SECOND);
}

void Datetime::get_timestamp(std::uint32_t& year, std::uint32_t& month, std::uint32_t& day,
                             std::uint32_t& hours, std::uint32_t& minutes, std::uint32_t& seconds,
                             std::uint32_t& microseconds, std::int32_t& utc) const {
  const auto when = static_cast<std::time_t>(usec() / SECOND);
  std::tm tm = {};
  localtime_r(&when, &tm);
  year = static_cast<std::uint32_t>(tm.tm_year + 1900);
  month = static_cast<std::uint32_t>(tm.tm_mon + 1);
  day = static_cast<std::uint32_t>(tm.tm_mday);
  hours = static_cast<std::uint32_t>(tm.tm_hour);
  minutes = static_cast<std::uint32_t>(tm.tm_min);
  seconds = static_cast<std::uint32_t>(tm.tm_sec);
  microseconds = static_cast<std::uint32_t>(usec() % SECOND);
  utc = _rep->utc;
}

void Datetime::usec(std::uint64_t value) {
  store(value, _rep->utc, _rep->is_timestamp);
}

void Datetime::utc(std::int32_t value) {
  store(_rep->usec, value, _rep->is_timestamp);
}

void Datetime::clear() {
  store(0, 0, 0);
}

void Datetime::interval_ascii(char* buffer, bool prettify) const {
  std::uint32_t days = 0, hours = 0, minutes = 0, seconds = 0, microseconds = 0;
  get_interval(days, hours, minutes, seconds, microseconds);
  std::snprintf(buffer, ASCII_SIZE,
                prettify ? "%08u %02u %02u %02u.%06u:000" : "%08u%02u%02u%02u.%06u:000", days,
                hours, minutes, seconds, microseconds);
}

void Datetime::timestamp_ascii(char* buffer, bool prettify) const {
  std::uint32_t year = 0, month = 0, day = 0, hours = 0, minutes = 0, seconds = 0, us = 0;
  std::int32_t offset = 0;
  get_timestamp(year, month, day, hours, minutes, seconds, us, offset);
  const char sign = offset >= 0 ? '+' : '-';
  const auto magnitude = std::llabs(offset);
  const auto i = [](std::uint32_t value) { return static_cast<int>(value); };
  std::snprintf(buffer, ASCII_SIZE,
                prettify ? "%04d/%02d/%02d %02d:%02d:%02d.%06d%c%03lld"
                         : "%04d%02d%02d%02d%02d%02d.%06d%c%03lld",
                i(year), i(month), i(day), i(hours), i(minutes), i(seconds), i(us), sign,
                magnitude);
}

void Datetime::ascii(char* buffer, bool prettify) const {
  if (is_interval()) {
    interval_ascii(buffer, prettify);
  } else {
    timestamp_ascii(buffer, prettify);
  }
}

void Datetime::print(std::FILE* stream, bool prettify) const {
  char text[ASCII_SIZE];
  ascii(text, prettify);
  std::fputs(text, stream);
}

bool Datetime::equal(const Datetime& other) const noexcept {
  return _rep == other._rep || (_rep->usec == other._rep->usec && _rep->utc == other._rep->utc &&
                                _rep->is_timestamp == other._rep->is_timestamp);
}

}  // namespace cimrt
