#include "services/TVX_XmlShape.h"

#include <algorithm>
#include <cstring>
#include <string_view>

namespace cimrt {

namespace {

/// Walks over a text by the parser's own rules: which characters end a name, what is passed over,
/// and where it gives up. Closing names are not compared, as the parser does not.
class Xml_Walk {
 public:
  explicit Xml_Walk(const char* text) : m_At(text) {}

  Xml_Shape measure() {
    skipMark();
    while (step()) {
    }
    return m_Shape;
  }

 private:
  static constexpr std::string_view BLANKS = " \n\r\t";
  static constexpr std::string_view NAME_ENDS = " \n\r\t/>?";
  static constexpr std::string_view ATTRIBUTE_NAME_ENDS = " \n\r\t/<>=?!";

  static bool isOneOf(char c, std::string_view set) {
    return set.find(c) != std::string_view::npos;
  }
  bool startsWith(std::string_view what) const {
    return std::strncmp(m_At, what.data(), what.size()) == 0;
  }
  void skipBlanks() {
    while (*m_At != '\0' && isOneOf(*m_At, BLANKS)) ++m_At;
  }
  /// False if there is no character of a name.
  bool skipName(std::string_view ends) {
    const char* const begin = m_At;
    while (*m_At != '\0' && !isOneOf(*m_At, ends)) ++m_At;
    return m_At != begin;
  }
  /// Passes one character. False, with nothing passed, if there is another.
  bool pass(char c) {
    if (*m_At != c) return false;
    ++m_At;
    return true;
  }
  /// Passes everything up to the end of `end`. False without one.
  bool passBehind(const char* end) {
    m_At = std::strstr(m_At, end);
    if (m_At != nullptr) m_At += std::strlen(end);
    return m_At != nullptr;
  }
  /// A byte order mark.
  void skipMark() {
    if (startsWith("\xEF\xBB\xBF")) m_At += 3;
  }

  /// One node, or one closing tag. False at the end.
  bool step() {
    if (m_Open == 0)
      skipBlanks();
    else
      m_At += std::strcspn(m_At, "<");
    if (!pass('<')) return false;
    if (m_Open > 0 && pass('/')) return passClosing();
    if (pass('?')) return passBehind("?>");
    return *m_At == '!' ? passMarkup() : passElement();
  }

  bool passClosing() {
    skipName(NAME_ENDS);
    skipBlanks();
    --m_Open;
    return pass('>');
  }

  /// What begins with "<!".
  bool passMarkup() {
    if (startsWith("!--")) return m_At += 3, passBehind("-->");
    if (startsWith("![CDATA[")) return m_At += 8, passBehind("]]>");
    if (startsWith("!DOCTYPE") && m_At[8] != '\0' && isOneOf(m_At[8], BLANKS))
      return m_At += 9, passDoctype();
    return passBehind(">");
  }

  /// Up to the ">" that stands in no brackets.
  bool passDoctype() {
    std::size_t brackets = 0;
    for (; *m_At != '\0'; ++m_At) {
      if (*m_At == '[') ++brackets;
      if (*m_At == ']' && brackets > 0) --brackets;
      if (*m_At == '>' && brackets == 0) return ++m_At, true;
    }
    return false;
  }

  bool passElement() {
    ++m_Shape.elements;
    m_Shape.depth = std::max(m_Shape.depth, m_Open + 1);
    if (!skipName(NAME_ENDS)) return false;
    skipBlanks();
    if (!passAttributes()) return false;
    if (pass('>')) return ++m_Open, true;
    return pass('/') && pass('>');
  }

  bool passAttributes() {
    while (skipName(ATTRIBUTE_NAME_ENDS)) {
      skipBlanks();
      if (!pass('=')) return false;
      skipBlanks();
      const char quote[] = {*m_At, '\0'};
      if (*quote != '"' && *quote != '\'') return false;
      ++m_At;
      if (!passBehind(quote)) return false;
      skipBlanks();
    }
    return true;
  }

  const char* m_At;
  std::size_t m_Open = 0;  ///< elements around the present place
  Xml_Shape m_Shape;
};

}  // namespace

Xml_Shape measureXml(const char* text) {
  return Xml_Walk(text).measure();
}

}  // namespace cimrt
