#include "cim/DateTimeText.h"

#include <fmt/format.h>

#include <chrono>

namespace tvx::host {
namespace {

constexpr std::size_t textLength = 25;
constexpr std::uint64_t perSecond = 1000000;
constexpr std::uint64_t perMinute = 60 * perSecond;
constexpr std::uint64_t perHour = 60 * perMinute;
constexpr std::uint64_t perDay = 24 * perHour;

bool isDigitOrStar(char c) {
  return (c >= '0' && c <= '9') || c == '*';
}

std::uint64_t number(std::string_view text, std::size_t start, std::size_t length) {
  std::uint64_t value = 0;
  for (const char c : text.substr(start, length)) {
    value = value * 10 + (c == '*' ? 0u : static_cast<unsigned>(c - '0'));
  }
  return value;
}

std::uint64_t timeOfDay(std::string_view text) {
  return number(text, 8, 2) * perHour + number(text, 10, 2) * perMinute +
         number(text, 12, 2) * perSecond + number(text, 15, 6);
}

/// Days since 1970-01-01, negative before it.
std::int64_t dayNumber(std::string_view text) {
  using namespace std::chrono;
  const year_month_day date(year(static_cast<int>(number(text, 0, 4))),
                            month(static_cast<unsigned>(number(text, 4, 2))),
                            day(static_cast<unsigned>(number(text, 6, 2))));
  return date.ok() ? sys_days(date).time_since_epoch().count() : -1;
}

}  // namespace

bool isDateTimeText(std::string_view text) {
  if (text.size() != textLength || text[14] != '.') {
    return false;
  }
  for (std::size_t i = 0; i < textLength; ++i) {
    if (i != 14 && i != 21 && !isDigitOrStar(text[i])) {
      return false;
    }
  }
  return text[21] == '+' || text[21] == '-' || text[21] == ':';
}

bool isIntervalText(std::string_view text) {
  return text.size() > 21 && text[21] == ':';
}

std::optional<std::uint64_t> dateTimeMicroseconds(std::string_view text) {
  if (!isDateTimeText(text)) {
    return std::nullopt;
  }
  if (isIntervalText(text)) {
    return number(text, 0, 8) * perDay + timeOfDay(text);
  }
  const std::int64_t days = dayNumber(text);
  if (days < 0) {
    return std::nullopt;
  }
  const std::uint64_t local = static_cast<std::uint64_t>(days) * perDay + timeOfDay(text);
  const std::uint64_t offset = number(text, 22, 3) * perMinute;
  if (text[21] == '-') {
    return local + offset;
  }
  return offset > local ? std::nullopt : std::optional(local - offset);
}

std::string dateTimeText(std::uint64_t microseconds, bool interval) {
  const std::uint64_t days = microseconds / perDay;
  const std::string time = fmt::format(
      "{:02}{:02}{:02}.{:06}", microseconds % perDay / perHour, microseconds % perHour / perMinute,
      microseconds % perMinute / perSecond, microseconds % perSecond);
  if (interval) {
    return fmt::format("{:08}{}:000", days % 100000000, time);
  }
  const std::chrono::year_month_day date{
      std::chrono::sys_days(std::chrono::days(static_cast<int>(days)))};
  return fmt::format("{:04}{:02}{:02}{}+000", static_cast<int>(date.year()),
                     static_cast<unsigned>(date.month()), static_cast<unsigned>(date.day()), time);
}

}  // namespace tvx::host
