// Walking of the meta data for the tests.
#pragma once

#include <cstddef>
#include <span>
#include <vector>

#include "generated/Repository.h"
#include "runtime/Meta_Class.h"

namespace cimrt::test {

inline std::span<const Meta_Class* const> all_classes() {
  return {meta_repository.meta_classes, meta_repository.num_meta_classes};
}

inline std::span<const Meta_Feature* const> features_of(const Meta_Record* record) {
  return {record->meta_features, record->num_meta_features};
}

inline std::size_t count(const Meta_Record* record, std::uint32_t mask) {
  std::size_t n = 0;
  for (const Meta_Feature* feature : features_of(record)) n += (feature->flags & mask) != 0;
  return n;
}

inline std::vector<const Meta_Method*> methods_of(const Meta_Class* meta_class) {
  std::vector<const Meta_Method*> methods;
  for (const Meta_Feature* feature : features_of(meta_class)) {
    if (is_method(feature)) methods.push_back(as_method(feature));
  }
  return methods;
}

inline const Meta_Class* class_named(const char* name) {
  return find_meta_class(&meta_repository, name);
}

}  // namespace cimrt::test
