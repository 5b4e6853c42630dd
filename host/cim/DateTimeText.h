// The 25-character text of CIM datetimes, and its binary form in microseconds.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace tvx::host {

/// True for `yyyymmddhhmmss.mmmmmmsutc` and `ddddddddhhmmss.mmmmmm:000`; digits may be asterisks.
bool isDateTimeText(std::string_view text);

/// True if the text is an interval. The text must be a datetime text.
bool isIntervalText(std::string_view text);

/// Microseconds: of the interval, or since 1970-01-01 00:00 UTC. Asterisks count as 0; nothing if
/// the text is no datetime or lies before 1970.
std::optional<std::uint64_t> dateTimeMicroseconds(std::string_view text);

/// Text of an interval, or of a point in time in UTC.
std::string dateTimeText(std::uint64_t microseconds, bool interval);

}  // namespace tvx::host
