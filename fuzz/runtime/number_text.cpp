// Every reader of numbers either refuses and leaves its output, or reads a value that its writer
// turns into a text that reads as the same value.
#include "Expect.h"
#include "runtime/Conversions.h"

using namespace cimrt;

namespace {

template <class T>
void try_integer(const char* text, int (*read)(const char*, T&),
                 const char* (*write)(char (&)[NUMBER_TEXT_SIZE], T, std::size_t&)) {
  constexpr T untouched = 77;
  T value = untouched;
  if (read(text, value) != 0) {
    fuzz::expect(value == untouched);
    return;
  }
  char buffer[NUMBER_TEXT_SIZE];
  std::size_t size = 0;
  const char* written = write(buffer, value, size);
  T again = 0;
  fuzz::expect(std::string(written).size() == size);
  fuzz::expect(read(written, again) == 0 && again == value);
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string text = fuzz::text_of(data, size);
  const char* t = text.c_str();
  try_integer(t, str_to_uint8, uint8_to_str);
  try_integer(t, str_to_uint16, uint16_to_str);
  try_integer(t, str_to_uint32, uint32_to_str);
  try_integer(t, str_to_uint64, uint64_to_str);
  try_integer(t, str_to_sint8, sint8_to_str);
  try_integer(t, str_to_sint16, sint16_to_str);
  try_integer(t, str_to_sint32, sint32_to_str);
  try_integer(t, str_to_sint64, sint64_to_str);
  bool boolean = false;
  fuzz::expect(str_to_boolean(t, boolean) != 0 || text.size() == (boolean ? 4u : 5u));
  float narrow = 0;
  double wide = 0;
  fuzz::expect(str_to_real32(t, narrow) == str_to_real64(t, wide));
  fuzz::expect(str_to_real64(t, wide) != 0 || text.find('.') != std::string::npos);
  Type type = NONE;
  fuzz::expect((str_to_type(t, type) == 0) == (type != NONE));
  return 0;
}
