// Any text is either refused, leaving the value, or read; an interval that was read and whose
// fields are in range is written back as the same text.
#include "Expect.h"
#include "runtime/Datetime.h"

using namespace cimrt;

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string text = fuzz::text_of(data, size);
  const Datetime before(42, 7);
  Datetime datetime(before);
  if (!datetime.set(text.c_str())) {
    fuzz::expect(datetime.equal(before));
    return 0;
  }
  fuzz::expect(text.size() == 25);
  char plain[Datetime::ASCII_SIZE];
  char pretty[Datetime::ASCII_SIZE];
  datetime.ascii(plain, false);
  datetime.ascii(pretty, true);
  if (datetime.is_timestamp()) return 0;
  Datetime again;
  // More than 99,999,999 days, by overflowing hours, do not fit the text.
  if (std::string(plain).size() == 25) {
    fuzz::expect(again.set(plain));
    fuzz::expect(again.equal(datetime));
  }
  return 0;
}
