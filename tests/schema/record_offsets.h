// What the compiler says about the typed records; the tables are written by record_offsets.py.
#pragma once

#include <cstddef>

namespace cimrt::test {

struct Record_Size {
  const char* class_name;
  std::size_t size;
};

struct Field_Offset {
  const char* class_name;
  const char* field;
  std::size_t offset;
};

extern const Record_Size record_sizes[];
extern const std::size_t num_record_sizes;
extern const Field_Offset field_offsets[];
extern const std::size_t num_field_offsets;

}  // namespace cimrt::test
