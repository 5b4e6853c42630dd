// World wide names as the simulator keeps them.
#pragma once

#include <array>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace tvx::sim {

/// A port or node name, most significant byte first.
using Wwn = std::array<std::uint8_t, 8>;

/// A port name with its node name.
struct Wwn_Pair {
  Wwn port{};
  Wwn node{};
  bool operator==(const Wwn_Pair&) const = default;
};

/// Reads 16 hexadecimal digits, or eight pairs separated by ":". Nothing for any other text.
std::optional<Wwn> parse_wwn(std::string_view text);

/// Eight upper-case pairs separated by ":", 23 characters.
std::string format_wwn(const Wwn& name);

/// The name as a number, most significant byte first; for counting names upwards.
std::uint64_t wwn_number(const Wwn& name);
Wwn wwn_from_number(std::uint64_t number);

}  // namespace tvx::sim
