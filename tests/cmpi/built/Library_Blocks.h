// Counts the memory that a loaded library holds, in a program that has its own operator new.
#pragma once

#include <cstddef>

namespace cimrt::test {

/// Only what code of the library asks for by itself counts: not what the program makes for it.
struct Library_Blocks {
  /// Takes the place of a loaded library's code, in place of one before it; false if it is not
  /// loaded.
  static bool watch(const char* library);
  /// Lets `number` blocks that the library asks for on the calling thread come, and the next one
  /// fail.
  static void fail_after(long number);
  /// No further one fails. True if one did.
  static bool stop();
  /// Blocks that were not given back, of all libraries that were watched.
  static std::size_t live();
};

}  // namespace cimrt::test
