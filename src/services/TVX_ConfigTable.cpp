#include "services/TVX_ConfigTable.h"

#include <sys/stat.h>

#include <algorithm>
#include <cstddef>
#include <cstdlib>
#include <cstring>
#include <iterator>
#include <memory>
#include <rapidxml/rapidxml.hpp>
#include <rapidxml/rapidxml_print.hpp>
#include <stdexcept>
#include <string_view>

#include "access/TVX_MethodWrapper.h"
#include "common/CLogger.h"
#include "common/TVX_File.h"
#include "common/TVX_Uri.h"
#include "services/TVX_XmlShape.h"

namespace cimrt {

// --- The table -----------------------------------------------------------------------------------

namespace {

constexpr std::size_t FIRST_ENTRY = offsetof(CPQFC_QoSTable, entry);
static_assert(sizeof(CPQFC_QoSEntry) == 36 && FIRST_ENTRY == 4);

std::size_t entryOffset(std::uint32_t i) {
  return FIRST_ENTRY + std::size_t{i} * sizeof(CPQFC_QoSEntry);
}

}  // namespace

TVX_QoSTable::TVX_QoSTable(std::uint32_t entries) {
  if (entries > MOST_QOS_ENTRIES) return;
  m_Block = tvxAllocate(std::max(entryOffset(entries), sizeof(CPQFC_QoSTable)));
  if (!m_Block) return;
  m_Room = entries;
  get()->numberOfEntries = entries;
}

std::uint32_t TVX_QoSTable::size() const {
  return m_Block ? std::min(get()->numberOfEntries, m_Room) : 0;
}

CPQFC_QoSEntry TVX_QoSTable::entry(std::uint32_t i) const {
  CPQFC_QoSEntry entry;
  std::memcpy(&entry, m_Block.get() + entryOffset(i), sizeof entry);
  return entry;
}

void TVX_QoSTable::setEntry(std::uint32_t i, const CPQFC_QoSEntry& entry) {
  std::memcpy(m_Block.get() + entryOffset(i), &entry, sizeof entry);
}

void PrintQoSEntry(const TVX_QoSTable& table) {
  TVX_LOG(TVX_DBG, "PrintQoSEntry");
  TVX_LOG(TVX_DBG, "Number Of Entries: %d", static_cast<int>(table.size()));
  for (std::uint32_t i = 0; i < table.size(); i++) {
    const CPQFC_QoSEntry entry = table.entry(i);
    for (const HBA_UINT8 byte : entry.source.wwn) TVX_LOG(TVX_DBG, "src_wwpn:%X", byte);
    for (const HBA_UINT8 byte : entry.target.wwn) TVX_LOG(TVX_DBG, "tgt_wwpn:%X", byte);
    TVX_LOG(TVX_DBG, "tag:%d", entry.tag);
  }
}

// --- Writing -------------------------------------------------------------------------------------

namespace {

using Document = rapidxml::xml_document<char>;
using Node = rapidxml::xml_node<char>;

constexpr const char* VERSION = "1.0";
constexpr const char* ENCODING = "utf-8";
constexpr const char* RESERVED1 = "00000000000000000000000000000000";
constexpr const char* RESERVED2 = "000000";

/// A document has room for its first nodes inside, which is much for a stack.
std::unique_ptr<Document> newDocument() {
  return std::make_unique<Document>();
}

/// Adds an element with a copy of the value, or a group without one.
Node* add(Document& document, Node& parent, const char* name, const std::string& value = {}) {
  const char* copy = value.empty() ? nullptr : document.allocate_string(value.c_str());
  Node* node = document.allocate_node(rapidxml::node_element, name, copy);
  parent.append_node(node);
  return node;
}

void addDeclaration(Document& document) {
  Node* declaration = document.allocate_node(rapidxml::node_declaration);
  declaration->append_attribute(document.allocate_attribute("version", VERSION));
  declaration->append_attribute(document.allocate_attribute("encoding", ENCODING));
  document.append_node(declaration);
}

std::string upperDigits(const HBA_WWN& wwn) {
  constexpr char DIGITS[] = "0123456789ABCDEF";
  std::string text;
  for (const HBA_UINT8 byte : wwn.wwn) {
    text += DIGITS[byte >> 4];
    text += DIGITS[byte & 15];
  }
  return text;
}

void addRow(Document& document, Node& configuration, const CPQFC_QoSEntry& entry) {
  Node& row = *add(document, configuration, "Row");
  add(document, row, "src_wwpn", upperDigits(entry.source));
  add(document, row, "tgt_wwpn", upperDigits(entry.target));
  add(document, row, "reserved1", RESERVED1);
  add(document, row, "tag", std::to_string(static_cast<int>(entry.tag)));
  add(document, row, "reserved2", RESERVED2);
}

}  // namespace

std::string writeConfigTable(const TVX_QoSTable& table, const Config_Table_Head& head) {
  const auto owner = newDocument();
  Document& document = *owner;
  addDeclaration(document);
  Node& root = *add(document, document, "ApexConfig");
  Node& system = *add(document, root, "theSystem");
  add(document, system, "ApexVersion", VERSION);
  add(document, system, "CreationDate", head.creationDate);
  add(document, system, "HostName", head.hostName);
  add(document, system, "Adapter", head.adapter);
  Node& configuration = *add(document, root, "Configuration");
  add(document, configuration, "numberOfEntries", std::to_string(table.size()));
  for (std::uint32_t i = 0; i < table.size(); i++) addRow(document, configuration, table.entry(i));
  std::string text;
  rapidxml::print(std::back_inserter(text), document);
  return text;
}

// --- Reading -------------------------------------------------------------------------------------

namespace {

// Bounds of what the parser is given: it calls itself for every element in an element, and makes
// about two hundred bytes of every element. A table has four levels and six elements a row.
constexpr std::size_t MOST_DEPTH = 64;
constexpr std::size_t MOST_ELEMENTS = 2U << 20;

void checkShape(const std::string& text) {
  const Xml_Shape shape = measureXml(text.c_str());
  if (shape.depth > MOST_DEPTH)
    throw std::runtime_error("the elements of the Apex config table are nested too deeply");
  if (shape.elements > MOST_ELEMENTS)
    throw std::runtime_error("the Apex config table has too many elements");
}

/// Throws that a node of the document is missing.
const Node& require(const Node* node, const char* what) {
  if (node) return *node;
  throw std::runtime_error(std::string(what) +
                           " is not found or corrupted in the Apex config table");
}

/// The rows of a document, and how many it says there are.
struct Table_Nodes {
  const Node& count;
  const Node& firstRow;
};

Table_Nodes findNodes(const Document& document) {
  const Node& root = require(document.first_node("ApexConfig"), "apexConfigNode");
  const Node& system = require(root.first_node("theSystem"), "theSystemNode");
  const Node& version = require(system.first_node("ApexVersion"), "apexVersionNode");
  require(version.next_sibling("CreationDate"), "creationTimeNode");
  require(version.next_sibling("HostName"), "hostNameNode");
  require(version.next_sibling("Adapter"), "adapterNode");
  const Node& configuration = require(system.next_sibling("Configuration"), "configurationNode");
  const Node& count = require(configuration.first_node("numberOfEntries"), "numberOfEntriesNode");
  return {count, require(count.next_sibling("Row"), "rowNode")};
}

/// The name in an element; zero, with the failure logged, if it is none.
HBA_WWN readName(const Node& node) {
  HBA_WWN wwn{};
  if (TVX_MethodWrapper::string2HBAName(&wwn, node.value()) == 1) return wwn;
  TVX_LOG(TVX_ERR, "SetConfigTable::unable to convert string to hbaname ");
  return {};
}

/// The fields of a row stand in one order. What comes behind a missing one is not looked for.
CPQFC_QoSEntry readRow(const Node& row) {
  CPQFC_QoSEntry entry{};
  const Node* source = row.first_node("src_wwpn");
  if (!source) {
    TVX_LOG(TVX_ERR, "SetConfigTable::malformed src_wwpn field ");
    return entry;
  }
  entry.source = readName(*source);
  const Node* target = source->next_sibling("tgt_wwpn");
  if (!target) {
    TVX_LOG(TVX_ERR, "SetConfigTable::malformed tgt_wwpn field ");
    return entry;
  }
  entry.target = readName(*target);
  const Node* tag = target->next_sibling("tag");
  if (!tag) {
    TVX_LOG(TVX_ERR, "SetConfigTable:: malformed tag field ");
    return entry;
  }
  entry.tag = static_cast<std::int8_t>(std::strtol(tag->value(), nullptr, 10) & 0xFF);
  return entry;
}

/// Room for a count as the document tells it.
TVX_QoSTable allocateTable(long count) {
  if (count > static_cast<long>(MOST_QOS_ENTRIES)) return {};
  return TVX_QoSTable(static_cast<std::uint32_t>(std::max(count, 0L)));
}

}  // namespace

TVX_QoSTable readConfigTable(std::string& text) {
  checkShape(text);
  const auto document = newDocument();
  document->parse<0>(text.data());
  const Table_Nodes nodes = findNodes(*document);
  TVX_QoSTable table = allocateTable(std::strtol(nodes.count.value(), nullptr, 10));
  if (!table) {
    TVX_LOG(TVX_DBG, "SetConfigTable::Memory Allocation Failed ");
    return table;
  }
  const Node* row = &nodes.firstRow;
  for (std::uint32_t i = 0; row && i < table.size(); i++) {
    table.setEntry(i, readRow(*row));
    row = row->next_sibling("Row");
  }
  return table;
}

// --- Files ---------------------------------------------------------------------------------------

namespace {

constexpr std::size_t MOST_BYTES = 256U << 20;

/// A pipe or a device would keep the reader waiting.
bool isPlainFile(std::FILE* stream) {
  struct stat info = {};
  return ::fstat(::fileno(stream), &info) == 0 && S_ISREG(info.st_mode);
}

bool readAll(std::FILE* stream, std::string& text) {
  char block[65536];
  while (const std::size_t size = std::fread(block, 1, sizeof block, stream)) {
    if (text.size() + size > MOST_BYTES) return false;
    text.append(block, size);
  }
  return std::ferror(stream) == 0;
}

}  // namespace

std::string readWholeFile(const char* path) {
  struct stat info = {};
  std::string text;
  if (::stat(path, &info) == 0 && S_ISREG(info.st_mode)) {
    const TVX_File stream = tvxOpenFile(path);
    if (stream && isPlainFile(stream.get()) && readAll(stream.get(), text)) return text;
  }
  throw std::runtime_error("cannot open file " + tvxWithoutPassword(path));
}

}  // namespace cimrt
