// The table of frame tags as an XML document, written and read.
#pragma once

#include <cstdint>
#include <string>

#include "common/TVX_Memory.h"
#include "rmapi/rmapi.h"

namespace cimrt {

/// More entries than this are taken for memory that there is not.
inline constexpr std::uint32_t MOST_QOS_ENTRIES = 1U << 18;

/// A table that never claims more entries than its block holds.
class TVX_QoSTable {
 public:
  TVX_QoSTable() = default;
  /// Room for so many entries, all zero, with the count set. Empty without memory.
  explicit TVX_QoSTable(std::uint32_t entries);

  explicit operator bool() const { return m_Block != nullptr; }
  /// The table as the library takes and fills it.
  CPQFC_QoSTable* get() const { return reinterpret_cast<CPQFC_QoSTable*>(m_Block.get()); }
  /// How many entries can be read: what the table claims, bounded by its room.
  std::uint32_t size() const;
  CPQFC_QoSEntry entry(std::uint32_t i) const;
  void setEntry(std::uint32_t i, const CPQFC_QoSEntry& entry);

 private:
  TVX_Block m_Block{};
  std::uint32_t m_Room = 0;
};

/// Logs every entry of a table.
void PrintQoSEntry(const TVX_QoSTable& table);

/// Who wrote a document, and when.
struct Config_Table_Head {
  std::string creationDate{};  ///< a CIM date and time
  std::string hostName{};
  std::string adapter{};  ///< device id of the port
};

/// The document of a table. Throws std::exception, std::bad_alloc among them.
std::string writeConfigTable(const TVX_QoSTable& table, const Config_Table_Head& head);

/// Reads a document. What a row lacks is logged, and is zero in its entry; so are the entries that
/// have no row. A count below 1 gives a table without entries.
/// @param text changed by the parser, and of no use afterwards
/// @return the table, which has the count that the document tells; empty, with the failure logged,
/// where there is no memory for it
/// Throws std::runtime_error for what is no document of a table: malformed, an element missing,
/// nested deeper or longer than any table; std::bad_alloc without memory.
TVX_QoSTable readConfigTable(std::string& text);

/// A whole file. Throws std::runtime_error "cannot open file " and its name for a file that can't
/// be read, or is too long for a table.
std::string readWholeFile(const char* path);

}  // namespace cimrt
