// Whatever is in a document of a table: its shape is measured as the parser sees it, and the reader
// answers a bounded table or an exception.
#include <algorithm>
#include <exception>
#include <memory>
#include <rapidxml/rapidxml.hpp>

#include "../runtime/Expect.h"
#include "services/TVX_ConfigTable.h"
#include "services/TVX_XmlShape.h"

using namespace cimrt;

namespace {

constexpr std::size_t MOST_DEPTH = 64;

/// Shape of what was parsed.
Xml_Shape shapeOf(const rapidxml::xml_node<char>& parent) {
  Xml_Shape shape;
  for (const auto* node = parent.first_node(); node; node = node->next_sibling()) {
    if (node->type() != rapidxml::node_element) continue;
    const Xml_Shape inside = shapeOf(*node);
    shape.elements += inside.elements + 1;
    shape.depth = std::max(shape.depth, inside.depth + 1);
  }
  return shape;
}

void compareShapes(std::string text) {
  const Xml_Shape measured = measureXml(text.c_str());
  if (measured.depth > MOST_DEPTH) return;
  const auto document = std::make_unique<rapidxml::xml_document<char>>();
  try {
    document->parse<0>(text.data());
  } catch (const rapidxml::parse_error&) {
    return;
  }
  const Xml_Shape parsed = shapeOf(*document);
  fuzz::expect(parsed.depth == measured.depth && parsed.elements == measured.elements);
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  std::string text = fuzz::text_of(data, size);
  compareShapes(text);
  try {
    const TVX_QoSTable table = readConfigTable(text);
    fuzz::expect(!table || table.size() == table.get()->numberOfEntries);
    fuzz::expect(table.size() <= MOST_QOS_ENTRIES);
  } catch (const std::exception&) {
  }
  return 0;
}
