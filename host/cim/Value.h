// CIM values, object paths and instances as plain C++ objects, independent of any broker object.
#pragma once

#include <cstdint>
#include <memory>
#include <optional>
#include <stdexcept>
#include <string>
#include <string_view>
#include <utility>
#include <variant>
#include <vector>

#include "cmpi/cmpidt.h"

namespace tvx::host {

struct ObjectPath;
struct Instance;

/// Thrown by the typed accessors of `Value` when the value holds something else.
class ValueError : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
};

/// One CIM value with its CMPI type code; copies are deep except for the shared, constant path,
/// instance or list that a reference, embedded instance or array holds. Not synchronised.
class Value {
 public:
  using List = std::vector<Value>;

  /// The null value of no type.
  Value() = default;

  static Value null(CMPIType type);
  static Value boolean(bool value);
  /// `type` is one of the unsigned integer codes or CMPI_char16; the value is cut to its width.
  static Value number(CMPIType type, std::uint64_t value);
  /// `type` is one of the signed integer codes; the value is cut to its width.
  static Value signedNumber(CMPIType type, std::int64_t value);
  static Value real(CMPIType type, double value);
  static Value string(std::string text);
  /// A string object that holds no text, which some servers hand out for missing texts.
  static Value stringWithoutText();
  /// `text` is the 25-character CIM form.
  static Value dateTime(std::string text);
  static Value reference(ObjectPath path);
  static Value embedded(Instance instance);
  /// `elementType` is a scalar code; each element has that type or is null.
  static Value array(CMPIType elementType, List elements);

  CMPIType type() const { return m_Type; }
  bool isNull() const { return m_bNull; }
  bool isArray() const { return (m_Type & CMPI_ARRAY) != 0; }
  CMPIType elementType() const { return static_cast<CMPIType>(m_Type & ~CMPI_ARRAY); }
  /// False for a string object without text, for null, and for values of other types.
  bool hasText() const { return std::holds_alternative<std::string>(m_Data); }

  // Typed access. Each throws ValueError naming the held type if it does not fit.
  bool asBoolean() const;
  /// Any integer that is not negative, or a character.
  std::uint64_t asUnsigned() const;
  /// Any integer that fits.
  std::int64_t asSigned() const;
  double asReal() const;
  /// Text of a string or datetime.
  const std::string& asText() const;
  const ObjectPath& asReference() const;
  const Instance& asInstance() const;
  const List& elements() const;
  /// Unsigned elements of an array of unsigned integers, for short assertions.
  std::vector<std::uint64_t> asUnsignedList() const;
  /// Texts of an array of strings.
  std::vector<std::string> asTextList() const;

  /// What a person reads: text unquoted, TRUE or FALSE, arrays with ", " between elements, "" if
  /// null.
  std::string display() const;

  /// Same type, same null mark and same contents.
  bool operator==(const Value& other) const;

 private:
  using Data = std::variant<std::monostate, bool, std::uint64_t, std::int64_t, double, std::string,
                            std::shared_ptr<const ObjectPath>, std::shared_ptr<const Instance>,
                            std::shared_ptr<const List>>;

  /// Holds `data` as what it is, without a detour over another variant.
  template <class T>
  Value(CMPIType type, T data)
      : m_Type(type), m_bNull(false), m_Data(std::in_place_type<T>, std::move(data)) {}
  template <class T>
  const T& get(const char* wanted) const;

  CMPIType m_Type = CMPI_null;
  bool m_bNull = true;
  Data m_Data;
};

/// A name with its value: a key, a property or an argument.
struct NamedValue {
  std::string name;
  Value value;

  bool operator==(const NamedValue& other) const;
};

/// Ordered named values; names are found without regard to the case of letters.
class NamedValues {
 public:
  using Items = std::vector<NamedValue>;

  NamedValues() = default;
  NamedValues(std::initializer_list<NamedValue> items) : m_Items(items) {}

  /// The value, or null if there is none of that name; valid until the next change.
  const Value* find(std::string_view name) const;
  /// Replaces the value of that name, or appends it.
  void set(std::string_view name, Value value);
  /// True if something was removed.
  bool remove(std::string_view name);

  std::size_t size() const { return m_Items.size(); }
  bool empty() const { return m_Items.empty(); }
  void reserve(std::size_t count) { m_Items.reserve(count); }
  Items::const_iterator begin() const { return m_Items.begin(); }
  Items::const_iterator end() const { return m_Items.end(); }
  /// Unchecked.
  const NamedValue& operator[](std::size_t index) const { return m_Items[index]; }
  /// Changes values in place.
  Items& items() { return m_Items; }

  /// Same names (any case) with equal values, in any order.
  bool operator==(const NamedValues& other) const;

 private:
  Items m_Items;
};

/// Name of an instance, or of a class when there are no keys.
struct ObjectPath {
  std::string host;
  std::string nameSpace;
  std::string className;
  NamedValues keys;

  /// Key by name; throws ValueError naming the path's class if there is none.
  const Value& key(std::string_view name) const;
  /// Same class (any case) and equal keys; namespace and host are not looked at. Integers compare
  /// by value whatever their width, because servers widen them.
  bool sameObject(const ObjectPath& other) const;
  bool operator==(const ObjectPath& other) const;
};

struct Instance {
  ObjectPath path;
  NamedValues properties;

  const std::string& className() const { return path.className; }
  /// Property by name; throws ValueError naming class and property if it is not there.
  const Value& property(std::string_view name) const;
  /// Display text of the property, "" if it is not there or null.
  std::string text(std::string_view name) const;
  bool has(std::string_view name) const { return properties.find(name) != nullptr; }
  /// Adds each key of the path as a property where there is none of its name: providers look for
  /// the keys of a changed instance among its properties.
  void addKeysAsProperties();
  bool operator==(const Instance& other) const;
};

/// Compares names as CIM does: ASCII letters without regard to case.
bool sameName(std::string_view a, std::string_view b);

}  // namespace tvx::host
