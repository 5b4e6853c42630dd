// A look at an XML text before it is parsed.
#pragma once

#include <cstddef>

namespace cimrt {

/// What a parse of the text would take.
struct Xml_Shape {
  std::size_t depth = 0;     ///< elements around the innermost one, itself included
  std::size_t elements = 0;  ///< also those behind which the text is malformed
};

/// Follows the text as the parser does, element by element, and needs no more stack for a deep one
/// than for a flat one. Ends where the parser would give up.
Xml_Shape measureXml(const char* text);

}  // namespace cimrt
