#include "agent/FCPortTables.h"

#include <algorithm>
#include <iterator>

namespace cimrt {

namespace {

constexpr Port_Status UNKNOWN_STATUS{1, 0, "Unknown"};
constexpr Port_Status STATUS_TABLE[] = {
    {2, 2, "OK"},
    {3, 10, "Stopped"},
    {4, 1, "Other"},
    {5, 11, "InService"},
    {6, 1, "Other"},
    {7, 6, "Error"},
    {8, 0x8008, "InService"},
    {20, 0x8014, "Operational. Need RESET"},
    {21, 0x8015, "Link down. Need RESET"},
    {22, 0x8016, "Disable"},
};

constexpr Port_Type UNKNOWN_TYPE{1, 0, "Unknown"};
constexpr Port_Type TYPE_TABLE[] = {
    {2, 1, "Other"},
    {5, 10, "N"},
    {6, 11, "NL"},
    {7, 16, "FL"},
    {8, 15, "F"},
    {9, 14, "E"},
    {10, 18, "G"},
    {20, 1, "Private Loop"},
    {21, 1, "Point to Point"},
};

struct Speed {
  std::uint32_t bit;
  std::uint64_t bitsPerSecond;
};

/// In the order in which a set of speeds is searched for its best.
constexpr Speed SPEED_TABLE[] = {
    {32, 16'000'000'000}, {4, 10'000'000'000}, {16, 8'000'000'000},
    {8, 4'000'000'000},   {2, 2'000'000'000},  {1, 1'000'000'000},
};

struct Bit_Value {
  std::uint32_t bit;
  std::uint16_t value;
};

constexpr Bit_Value SERVICE_CLASS_TABLE[] = {{0, 7}, {1, 1}, {2, 2}, {3, 3}, {4, 4}, {6, 5}};

struct Fc4_Bit {
  std::size_t word;
  std::uint32_t bit;
  std::uint16_t value;
};

constexpr Fc4_Bit FC4_TABLE[] = {
    {3, 4, 4},  {3, 5, 5},  {2, 0, 8},  {2, 1, 9},  {1, 1, 17},  {1, 2, 18},
    {1, 3, 19}, {1, 5, 21}, {1, 6, 22}, {1, 7, 23}, {0, 1, 25},  {0, 2, 26},
    {0, 3, 27}, {0, 4, 28}, {7, 0, 32}, {7, 2, 34}, {7, 4, 36},  {11, 0, 64},
    {9, 0, 80}, {9, 1, 81}, {9, 2, 82}, {8, 0, 88}, {15, 0, 96},
};
constexpr std::uint16_t FC4_OTHER = 1;

}  // namespace

const Port_Status& portStatus(std::uint32_t portState) {
  const auto* row = std::find_if(std::begin(STATUS_TABLE), std::end(STATUS_TABLE),
                                 [=](const Port_Status& r) { return r.state == portState; });
  return row == std::end(STATUS_TABLE) ? UNKNOWN_STATUS : *row;
}

const Port_Type& portType(std::uint32_t libraryType) {
  const auto* row = std::find_if(std::begin(TYPE_TABLE), std::end(TYPE_TABLE),
                                 [=](const Port_Type& r) { return r.type == libraryType; });
  return row == std::end(TYPE_TABLE) ? UNKNOWN_TYPE : *row;
}

std::uint64_t portSpeed(std::uint32_t speed) {
  for (const Speed& row : SPEED_TABLE)
    if (row.bit == speed) return row.bitsPerSecond;
  return 0;
}

std::uint64_t maxPortSpeed(std::uint32_t speeds) {
  for (const Speed& row : SPEED_TABLE)
    if (speeds & row.bit) return row.bitsPerSecond;
  return 0;
}

Array<std::uint16_t> classesOfService(std::uint32_t bits) {
  Array<std::uint16_t> classes;
  for (const Bit_Value& row : SERVICE_CLASS_TABLE)
    if (bits >> row.bit & 1) classes.append(row.value);
  if (classes.size() == 0) classes.append(0);
  return classes;
}

Array<std::uint16_t> fc4Types(const std::array<std::uint32_t, 32>& mask) {
  std::array<std::uint32_t, 32> rest = mask;
  Array<std::uint16_t> types;
  for (const Fc4_Bit& row : FC4_TABLE) {
    if ((rest[row.word] >> row.bit & 1) == 0) continue;
    types.append(row.value);
    rest[row.word] &= ~(1u << row.bit);
  }
  if (std::any_of(rest.begin(), rest.end(), [](std::uint32_t word) { return word != 0; }))
    types.append(FC4_OTHER);
  if (types.size() == 0) types.append(0);
  return types;
}

}  // namespace cimrt
