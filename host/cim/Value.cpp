#include "cim/Value.h"

#include <algorithm>
#include <charconv>
#include <cmath>

#include "cim/PathText.h"
#include "cim/TypeNames.h"

namespace tvx::host {
namespace {

char lower(char c) {
  return (c >= 'A' && c <= 'Z') ? static_cast<char>(c - 'A' + 'a') : c;
}

unsigned widthOf(CMPIType type) {
  switch (type) {
    case CMPI_uint8:
    case CMPI_sint8:
      return 8;
    case CMPI_uint16:
    case CMPI_sint16:
    case CMPI_char16:
      return 16;
    case CMPI_uint32:
    case CMPI_sint32:
      return 32;
    default:
      return 64;
  }
}

bool isInteger(const Value& value) {
  const CMPIType type = value.type();
  return type >= CMPI_uint8 && type <= CMPI_sint64 && !value.isNull();
}

bool sameInteger(const Value& a, const Value& b) {
  const auto negative = [](const Value& v) { return v.type() >= CMPI_SINT && v.asSigned() < 0; };
  if (negative(a) || negative(b)) {
    return negative(a) && negative(b) && a.asSigned() == b.asSigned();
  }
  return a.asUnsigned() == b.asUnsigned();
}

bool sameKeyValue(const Value& a, const Value& b) {
  if (isInteger(a) && isInteger(b)) {
    return sameInteger(a, b);
  }
  if (a.type() == CMPI_ref && b.type() == CMPI_ref && !a.isNull() && !b.isNull()) {
    return a.asReference().sameObject(b.asReference());
  }
  return a == b;
}

std::string realText(double value, bool single) {
  char buffer[40];
  const auto end = single ? std::to_chars(buffer, buffer + sizeof buffer, static_cast<float>(value))
                          : std::to_chars(buffer, buffer + sizeof buffer, value);
  return std::string(buffer, end.ptr);
}

template <class T>
bool samePointee(const std::shared_ptr<const T>& a, const std::shared_ptr<const T>& b) {
  return a == b || (a && b && *a == *b);
}

}  // namespace

bool sameName(std::string_view a, std::string_view b) {
  return a.size() == b.size() && std::equal(a.begin(), a.end(), b.begin(),
                                            [](char x, char y) { return lower(x) == lower(y); });
}

Value Value::null(CMPIType type) {
  Value value;
  value.m_Type = type;
  return value;
}

Value Value::boolean(bool value) {
  return Value(CMPI_boolean, value);
}

Value Value::number(CMPIType type, std::uint64_t value) {
  const unsigned width = widthOf(type);
  return Value(type, width == 64 ? value : value & ((std::uint64_t{1} << width) - 1));
}

Value Value::signedNumber(CMPIType type, std::int64_t value) {
  switch (widthOf(type)) {
    case 8:
      return Value(type, std::int64_t{static_cast<std::int8_t>(value)});
    case 16:
      return Value(type, std::int64_t{static_cast<std::int16_t>(value)});
    case 32:
      return Value(type, std::int64_t{static_cast<std::int32_t>(value)});
    default:
      return Value(type, value);
  }
}

Value Value::real(CMPIType type, double value) {
  return Value(type, value);
}

Value Value::string(std::string text) {
  return Value(CMPI_string, std::move(text));
}

Value Value::stringWithoutText() {
  return Value(CMPI_string, std::monostate{});
}

Value Value::dateTime(std::string text) {
  return Value(CMPI_dateTime, std::move(text));
}

Value Value::reference(ObjectPath path) {
  return Value(CMPI_ref, std::make_shared<const ObjectPath>(std::move(path)));
}

Value Value::embedded(Instance instance) {
  return Value(CMPI_instance, std::make_shared<const Instance>(std::move(instance)));
}

Value Value::array(CMPIType elementType, List elements) {
  return Value(static_cast<CMPIType>(elementType | CMPI_ARRAY),
               std::make_shared<const List>(std::move(elements)));
}

template <class T>
const T& Value::get(const char* wanted) const {
  if (const T* data = std::get_if<T>(&m_Data)) {
    return *data;
  }
  throw ValueError(std::string("expected ") + wanted + ", found " + (m_bNull ? "null of " : "") +
                   typeName(m_Type));
}

bool Value::asBoolean() const {
  return get<bool>("a boolean");
}

std::uint64_t Value::asUnsigned() const {
  if (const auto* negative = std::get_if<std::int64_t>(&m_Data)) {
    if (*negative < 0) {
      throw ValueError("expected an unsigned integer, found " + std::to_string(*negative));
    }
    return static_cast<std::uint64_t>(*negative);
  }
  return get<std::uint64_t>("an unsigned integer");
}

std::int64_t Value::asSigned() const {
  if (const auto* big = std::get_if<std::uint64_t>(&m_Data)) {
    if (*big > static_cast<std::uint64_t>(INT64_MAX)) {
      throw ValueError("expected a signed integer, found " + std::to_string(*big));
    }
    return static_cast<std::int64_t>(*big);
  }
  return get<std::int64_t>("a signed integer");
}

double Value::asReal() const {
  return get<double>("a real");
}

const std::string& Value::asText() const {
  return get<std::string>("a text");
}

const ObjectPath& Value::asReference() const {
  return *get<std::shared_ptr<const ObjectPath>>("a reference");
}

const Instance& Value::asInstance() const {
  return *get<std::shared_ptr<const Instance>>("an instance");
}

const Value::List& Value::elements() const {
  return *get<std::shared_ptr<const List>>("an array");
}

std::vector<std::uint64_t> Value::asUnsignedList() const {
  std::vector<std::uint64_t> list;
  for (const Value& element : elements()) {
    list.push_back(element.asUnsigned());
  }
  return list;
}

std::vector<std::string> Value::asTextList() const {
  std::vector<std::string> list;
  for (const Value& element : elements()) {
    list.push_back(element.asText());
  }
  return list;
}

std::string Value::display() const {
  if (const auto* truth = std::get_if<bool>(&m_Data)) {
    return *truth ? "TRUE" : "FALSE";
  }
  if (const auto* number = std::get_if<std::uint64_t>(&m_Data)) {
    return std::to_string(*number);
  }
  if (const auto* number = std::get_if<std::int64_t>(&m_Data)) {
    return std::to_string(*number);
  }
  if (const auto* number = std::get_if<double>(&m_Data)) {
    return realText(*number, m_Type == CMPI_real32);
  }
  if (const auto* text = std::get_if<std::string>(&m_Data)) {
    return *text;
  }
  if (const auto* path = std::get_if<std::shared_ptr<const ObjectPath>>(&m_Data)) {
    return printPath(**path);
  }
  if (const auto* instance = std::get_if<std::shared_ptr<const Instance>>(&m_Data)) {
    return "instance of " + (*instance)->className();
  }
  std::string text;
  if (const auto* shared = std::get_if<std::shared_ptr<const List>>(&m_Data)) {
    const List* const list = shared->get();
    for (const Value& element : *list) {
      text += (text.empty() && &element == &list->front() ? "" : ", ") + element.display();
    }
  }
  return text;
}

bool Value::operator==(const Value& other) const {
  if (m_Type != other.m_Type || m_bNull != other.m_bNull ||
      m_Data.index() != other.m_Data.index()) {
    return false;
  }
  if (const auto* path = std::get_if<std::shared_ptr<const ObjectPath>>(&m_Data)) {
    return samePointee(*path, std::get<std::shared_ptr<const ObjectPath>>(other.m_Data));
  }
  if (const auto* instance = std::get_if<std::shared_ptr<const Instance>>(&m_Data)) {
    return samePointee(*instance, std::get<std::shared_ptr<const Instance>>(other.m_Data));
  }
  if (const auto* list = std::get_if<std::shared_ptr<const List>>(&m_Data)) {
    return samePointee(*list, std::get<std::shared_ptr<const List>>(other.m_Data));
  }
  return m_Data == other.m_Data;
}

bool NamedValue::operator==(const NamedValue& other) const {
  return sameName(name, other.name) && value == other.value;
}

const Value* NamedValues::find(std::string_view name) const {
  const auto found = std::find_if(m_Items.begin(), m_Items.end(), [&](const NamedValue& item) {
    return sameName(item.name, name);
  });
  return found == m_Items.end() ? nullptr : &found->value;
}

void NamedValues::set(std::string_view name, Value value) {
  const auto found = std::find_if(m_Items.begin(), m_Items.end(), [&](const NamedValue& item) {
    return sameName(item.name, name);
  });
  if (found == m_Items.end()) {
    m_Items.push_back({std::string(name), std::move(value)});
  } else {
    found->value = std::move(value);
  }
}

bool NamedValues::remove(std::string_view name) {
  return std::erase_if(m_Items,
                       [&](const NamedValue& item) { return sameName(item.name, name); }) != 0;
}

bool NamedValues::operator==(const NamedValues& other) const {
  return size() == other.size() && std::all_of(begin(), end(), [&](const NamedValue& item) {
           const Value* value = other.find(item.name);
           return value != nullptr && *value == item.value;
         });
}

const Value& ObjectPath::key(std::string_view name) const {
  if (const Value* value = keys.find(name)) {
    return *value;
  }
  throw ValueError("path of class " + className + " has no key " + std::string(name));
}

bool ObjectPath::sameObject(const ObjectPath& other) const {
  return sameName(className, other.className) && keys.size() == other.keys.size() &&
         std::all_of(keys.begin(), keys.end(), [&](const NamedValue& key) {
           const Value* value = other.keys.find(key.name);
           return value != nullptr && sameKeyValue(*value, key.value);
         });
}

bool ObjectPath::operator==(const ObjectPath& other) const {
  return sameName(host, other.host) && sameName(nameSpace, other.nameSpace) && sameObject(other);
}

const Value& Instance::property(std::string_view name) const {
  if (const Value* value = properties.find(name)) {
    return *value;
  }
  throw ValueError("instance of " + className() + " has no property " + std::string(name));
}

std::string Instance::text(std::string_view name) const {
  const Value* value = properties.find(name);
  return value == nullptr ? std::string() : value->display();
}

void Instance::addKeysAsProperties() {
  for (const NamedValue& key : path.keys) {
    if (!has(key.name)) {
      properties.set(key.name, key.value);
    }
  }
}

bool Instance::operator==(const Instance& other) const {
  return path == other.path && properties == other.properties;
}

}  // namespace tvx::host
