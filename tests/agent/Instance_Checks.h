// Reading instances in assertions.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "runtime/Instance.h"

namespace cimrt::test {

/// The value of a text property, or "(null)".
inline std::string textOf(const Property<String>& property) {
  return property.is_null() ? "(null)" : property.value.c_str();
}

/// The elements of an array of texts; none if it is null.
inline std::vector<std::string> textsOf(const Property<Array<String>>& property) {
  std::vector<std::string> result;
  if (property.is_null()) return result;
  for (const String& value : property.value) result.emplace_back(value.c_str());
  return result;
}

/// The elements of an array of numbers; none if it is null.
template <class T>
std::vector<T> numbersOf(const Property<Array<T>>& property) {
  if (property.is_null()) return {};
  return {property.value.begin(), property.value.end()};
}

/// The number, or -1 for null.
template <class T>
std::int64_t numberOf(const Property<T>& property) {
  return property.is_null() ? -1 : static_cast<std::int64_t>(property.value);
}

/// The references of an association, in the order of its class.
inline std::vector<const Instance*> endsOf(const Instance* association) {
  std::vector<const Instance*> ends;
  const Meta_Class* metaClass = class_of(association);
  for (std::uint64_t i = 0; i < metaClass->num_meta_features; i++)
    if (is_reference(metaClass->meta_features[i]))
      ends.push_back(
          *static_cast<Instance* const*>(storage(association, metaClass->meta_features[i])));
  return ends;
}

/// True if the association ties clones of these two, in this order.
inline bool tiesClones(const Instance* association, const Instance* first, const Instance* second) {
  const std::vector<const Instance*> ends = endsOf(association);
  return first && second && ends.size() == 2 && ends[0] && ends[1] && ends[0] != first &&
         ends[1] != second && identical(ends[0], first) && identical(ends[1], second);
}

/// The same by keys alone, for ends that changed after the association was made.
inline bool tiesKeys(const Instance* association, const Instance* first, const Instance* second) {
  const std::vector<const Instance*> ends = endsOf(association);
  return first && second && ends.size() == 2 && ends[0] && ends[1] && key_eq(ends[0], first) &&
         key_eq(ends[1], second);
}

/// The entry of a map with that text in a property, or null.
template <class T, class Map>
T* entryOf(Map& map, Property<String> T::*property, const std::string& text) {
  for (std::size_t i = 0; i < map.size(); i++)
    if (textOf(map[i]->*property) == text) return map[i];
  return nullptr;
}

}  // namespace cimrt::test
