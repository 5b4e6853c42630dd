// Tagged attribute values: what an adapter or port reports, and the block that carries them.
#pragma once

#include <cstddef>
#include <cstdint>
#include <map>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

namespace tvx::sim {

using Bytes = std::vector<std::uint8_t>;

/// Attribute values by their number.
using Attribute_Map = std::map<std::uint32_t, Bytes>;

enum class Attribute_Kind { Number, Number64, Text, Raw };

/// One attribute as a scenario names it.
struct Attribute_Row {
  std::uint32_t id;
  Attribute_Kind kind;
  const char* name;  ///< member name in a scenario
};

/// What a card reports about itself; the numbers of LRM_GetHBAAttributes.
std::span<const Attribute_Row> card_attribute_rows();
/// What a port reports; the numbers of LRM_GetPortAttributes.
std::span<const Attribute_Row> port_attribute_rows();
/// The counters of LRM_GetPortStatistics.
std::span<const Attribute_Row> statistic_rows();
/// What a logical unit reports; the numbers of LRM_GetLunAttributes.
std::span<const Attribute_Row> lun_attribute_rows();

/// The row with this member name; null when there is none.
const Attribute_Row* find_row(std::span<const Attribute_Row> rows, std::string_view name);
/// The number of an attribute given by member name or as a number ("0x227"); nothing if unknown.
std::optional<std::uint32_t> attribute_number(std::span<const Attribute_Row> rows,
                                              const std::string& name);

Bytes number_value(std::uint32_t number);
Bytes number64_value(std::uint64_t number);
/// The text with its closing zero.
Bytes text_value(std::string_view text);

/// Writes the block that LRM_Get...Attributes fills: a header with the block's size, then number,
/// length and value of each attribute, each value on a multiple of eight bytes. Answers the size of
/// the block; writes nothing when `room` is smaller.
std::size_t write_block(const Attribute_Map& values, void* buffer, std::size_t room);

struct Block_Value {
  const void* data = nullptr;
  std::uint32_t length = 0;
};

/// Finds an attribute in a block written by `write_block`. Nothing if it is absent or `block` is
/// not such a block. The value lies inside the block.
std::optional<Block_Value> find_in_block(const void* block, std::uint32_t id);

}  // namespace tvx::sim
