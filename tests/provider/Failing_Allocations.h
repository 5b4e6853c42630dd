// Lets allocations of one library fail, in a program that has its own operator new.
#pragma once

namespace tvx::test {

/// Only what code of the watched library asks for by itself fails, on the thread that wants it so.
struct Allocations {
  /// Takes the place of a loaded library's code; false if it is not loaded.
  static bool watch(const char* library);
  /// Lets `number` allocations of the calling thread succeed and the next one fail.
  static void failAfter(long number);
  /// No further one fails. True if one did.
  static bool stop();
};

}  // namespace tvx::test
