// Remote ports and their logical units, and what those answer to SCSI commands.
#pragma once

#include <array>
#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <vector>

#include "state/Attributes.h"
#include "state/Wwn.h"

namespace tvx::sim {

/// Logical units that differ in nothing but their number: `count` of them from `first` on.
struct Lun_Group {
  std::uint64_t first = 0;
  std::uint32_t count = 1;
  std::uint8_t type = 0;  ///< SCSI peripheral device type
  std::string vendor;
  std::string model;
  std::string revision;
  std::string serial;  ///< without the number of the unit, which is appended
  std::uint32_t block_size = 512;
  std::uint64_t blocks = 0;          ///< 0: the unit has no capacity to tell
  std::uint8_t identifier_type = 3;  ///< of page 0x83
  std::uint8_t identifier_code = 1;  ///< code set: 1 binary, 2 text
  Bytes identifier;                  ///< in a group of several, the last four bytes are the number
  std::map<std::uint32_t, Bytes> pages;  ///< answers as they stand, in place of the made ones
  std::string os_device;                 ///< name without the number; empty: by the type

  bool contains(std::uint64_t lun) const { return lun >= first && lun - first < count; }
};

/// A remote port as one local port sees it.
struct Target {
  Wwn_Pair names;
  std::uint32_t fc_id = 0;
  std::vector<Lun_Group> groups;

  const Lun_Group* find_group(std::uint64_t lun) const;
  std::uint64_t unit_count() const;
};

/// The eight LUN bytes of a unit number, as the fabric carries them: peripheral addressing below
/// 256, flat addressing below 16384, extended flat addressing above.
std::array<std::uint8_t, 8> lun_bytes(std::uint64_t lun);
/// The unit number of such bytes; nothing for a form that `lun_bytes` never makes.
std::optional<std::uint64_t> lun_number(const std::array<std::uint8_t, 8>& bytes);

/// The page number that stands for the standard inquiry data in `inquiry_answer` and in faults.
constexpr std::uint32_t standard_page = 0x100;

/// What the unit answers to INQUIRY; nothing for a page that it does not have.
std::optional<Bytes> inquiry_answer(const Lun_Group& group, std::uint64_t lun, std::uint32_t page);
/// What it answers to READ CAPACITY: eight bytes, or sixteen where the last block needs more than
/// 32 bits; nothing for a unit without capacity.
std::optional<Bytes> capacity_answer(const Lun_Group& group);

/// Fixed format sense data.
Bytes sense_data(std::uint8_t key, std::uint8_t code, std::uint8_t qualifier);

/// Name of the unit in the operating system; `ordinal` counts the units of the port.
std::string os_device_name(const Lun_Group& group, std::uint64_t ordinal);

}  // namespace tvx::sim
