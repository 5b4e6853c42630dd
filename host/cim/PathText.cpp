#include "cim/PathText.h"

#include <fmt/format.h>

#include <charconv>

#include "cim/ClassCatalogue.h"
#include "cim/DateTimeText.h"
#include "cim/TypeNames.h"

namespace tvx::host {
namespace {

/// Reads one path text from left to right.
class PathReader {
 public:
  PathReader(std::string_view text, const std::string& defaultNameSpace)
      : m_Text(text), m_DefaultNameSpace(defaultNameSpace) {}

  ObjectPath read() {
    ObjectPath path;
    const std::size_t equals = m_Text.find('=');
    const std::string_view head = m_Text.substr(0, equals);
    const std::size_t colon = head.rfind(':');
    readPlace(colon == std::string_view::npos ? std::string_view() : head.substr(0, colon), path);
    m_Position = colon == std::string_view::npos ? 0 : colon + 1;
    readClass(path);
    readKeys(path);
    return path;
  }

 private:
  [[noreturn]] void fail(const std::string& expected) const {
    throw PathError(fmt::format("bad object path '{}': expected {} at character {}", m_Text,
                                expected, m_Position + 1));
  }

  void readPlace(std::string_view place, ObjectPath& path) {
    const std::size_t scheme = place.find("//");
    if (scheme != std::string_view::npos) {
      place.remove_prefix(scheme + 2);
      const std::size_t slash = place.find('/');
      path.host = place.substr(0, slash);
      place = slash == std::string_view::npos ? std::string_view() : place.substr(slash + 1);
    }
    path.nameSpace = place.empty() ? m_DefaultNameSpace : std::string(place);
  }

  void readClass(ObjectPath& path) {
    path.className = readName("a class name");
    if (m_Text.substr(m_Position) == "=@") {
      m_Position = m_Text.size();
    }
  }

  void readKeys(ObjectPath& path) {
    if (m_Position == m_Text.size()) {
      return;
    }
    if (m_Text[m_Position] != '.') {
      fail("'.' before the first key");
    }
    do {
      ++m_Position;
      std::string name = readName("a key name");
      if (m_Position == m_Text.size() || m_Text[m_Position] != '=') {
        fail("'=' after the key name " + name);
      }
      ++m_Position;
      if (path.keys.find(name) != nullptr) {
        m_Position -= name.size() + 1;
        fail("the key " + name + " only once");
      }
      path.keys.set(name, readValue());
    } while (m_Position < m_Text.size() && m_Text[m_Position] == ',');
    if (m_Position != m_Text.size()) {
      fail("',' or the end");
    }
  }

  std::string readName(const char* what) {
    const std::size_t start = m_Position;
    while (m_Position < m_Text.size() && isNameCharacter(m_Text[m_Position])) {
      ++m_Position;
    }
    if (start == m_Position) {
      fail(what);
    }
    return std::string(m_Text.substr(start, m_Position - start));
  }

  static bool isNameCharacter(char c) {
    return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9') || c == '_';
  }

  Value readValue() {
    if (m_Position < m_Text.size() && m_Text[m_Position] == '"') {
      return Value::string(readQuoted());
    }
    const std::size_t end = std::min(m_Text.find(',', m_Position), m_Text.size());
    const std::string_view word = m_Text.substr(m_Position, end - m_Position);
    Value value = wordValue(word);
    m_Position = end;
    return value;
  }

  std::string readQuoted() {
    std::string text;
    for (++m_Position; m_Position < m_Text.size(); ++m_Position) {
      char c = m_Text[m_Position];
      if (c == '"') {
        ++m_Position;
        return text;
      }
      if (c == '\\' && m_Position + 1 < m_Text.size()) {
        c = m_Text[++m_Position];
      }
      text += c;
    }
    fail("a closing '\"'");
  }

  static bool wholeWord(const std::from_chars_result& result, std::string_view word) {
    return !word.empty() && result.ec == std::errc() && result.ptr == word.data() + word.size();
  }

  Value wordValue(std::string_view word) const {
    if (sameName(word, "true") || sameName(word, "false")) {
      return Value::boolean(sameName(word, "true"));
    }
    std::uint64_t number = 0;
    std::int64_t negative = 0;
    const char* end = word.data() + word.size();
    if (wholeWord(std::from_chars(word.data(), end, number), word)) {
      return Value::number(CMPI_uint64, number);
    }
    if (wholeWord(std::from_chars(word.data(), end, negative), word)) {
      return Value::signedNumber(CMPI_sint64, negative);
    }
    fail("a text in double quotes, a number, TRUE or FALSE");
  }

  std::string_view m_Text;
  const std::string& m_DefaultNameSpace;
  std::size_t m_Position = 0;
};

Value integerKey(const FeatureData& feature, const Value& value) {
  const std::string text = value.display();
  std::uint64_t number = 0;
  std::int64_t negative = 0;
  const char* end = text.data() + text.size();
  const CMPIType type = feature.cmpiType;
  const bool isSigned = type >= CMPI_SINT && type <= CMPI_sint64;
  Value typed;
  if (isSigned && std::from_chars(text.data(), end, negative).ptr == end && !text.empty()) {
    typed = Value::signedNumber(type, negative);
  } else if (!isSigned && std::from_chars(text.data(), end, number).ptr == end && !text.empty()) {
    typed = Value::number(type, number);
  }
  if (typed.isNull() || typed.display() != text) {
    throw PathError(fmt::format("key {} is a {}, '{}' is not", feature.name, typeName(type), text));
  }
  return typed;
}

Value typedKey(const FeatureData& feature, const Value& value, const ObjectPath& path,
               const ClassCatalogue& classes) {
  const CMPIType type = feature.cmpiType;
  if (value.isNull()) {
    return Value::null(type);
  }
  if (type == value.type() && type != CMPI_ref) {
    return value;
  }
  if (type == CMPI_ref) {
    if (value.type() == CMPI_ref) {
      ObjectPath nested = value.asReference();
      typeKeys(nested, classes);
      return Value::reference(std::move(nested));
    }
    return Value::reference(parsePath(value.display(), path.nameSpace, &classes));
  }
  if (type == CMPI_string) {
    return Value::string(value.display());
  }
  if (type == CMPI_dateTime && value.hasText() && isDateTimeText(value.asText())) {
    return Value::dateTime(value.asText());
  }
  if (type >= CMPI_uint8 && type <= CMPI_sint64) {
    return integerKey(feature, value);
  }
  throw PathError(fmt::format("key {} of {} is a {}, '{}' is not", feature.name, path.className,
                              typeName(type), value.display()));
}

std::string printValue(const Value& value) {
  if (value.type() == CMPI_ref && !value.isNull()) {
    return quotedText(printPath(value.asReference()));
  }
  if (value.type() == CMPI_string || value.type() == CMPI_dateTime || value.isNull()) {
    return quotedText(value.display());
  }
  return value.display();
}

std::string keyNames(const ClassData& classData) {
  std::string names;
  for (const FeatureData& feature : features(classData)) {
    if (feature.isKey) {
      names += (names.empty() ? "" : ", ") + std::string(feature.name);
    }
  }
  return names;
}

}  // namespace

ObjectPath parsePath(std::string_view text, const std::string& defaultNameSpace,
                     const ClassCatalogue* classes) {
  ObjectPath path = PathReader(text, defaultNameSpace).read();
  if (classes != nullptr) {
    typeKeys(path, *classes);
  }
  return path;
}

void typeKeys(ObjectPath& path, const ClassCatalogue& classes) {
  const ClassData* classData = classes.find(path.className);
  if (classData == nullptr) {
    return;
  }
  path.className = classData->name;
  for (NamedValue& key : path.keys.items()) {
    const FeatureData* feature = findFeature(*classData, key.name);
    if (feature == nullptr || !feature->isKey) {
      throw PathError(fmt::format("class {} has no key '{}'; its keys are: {}", classData->name,
                                  key.name, keyNames(*classData)));
    }
    key.name = feature->name;
    key.value = typedKey(*feature, key.value, path, classes);
  }
}

std::string printPath(const ObjectPath& path) {
  std::string text;
  if (!path.host.empty()) {
    text += "//" + path.host + "/";
  }
  if (!path.nameSpace.empty()) {
    text += path.nameSpace + ":";
  }
  text += path.className;
  char separator = '.';
  for (const NamedValue& key : path.keys) {
    text += separator + key.name + "=" + printValue(key.value);
    separator = ',';
  }
  return text;
}

std::string quotedText(std::string_view text) {
  std::string result = "\"";
  for (const char c : text) {
    if (c == '"' || c == '\\') {
      result += '\\';
    }
    result += c;
  }
  return result + "\"";
}

}  // namespace tvx::host
