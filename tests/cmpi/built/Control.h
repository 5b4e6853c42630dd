// How a test program tells the providers of the test library what to do, past the CMPI border that
// it tries. Plain functions: program and library share no runtime objects.
#pragma once

#include <cstddef>
#include <cstdint>

#include "cmpi/cmpift.h"

namespace cimrt::test {

/// Functions of the test library. Class names are those of `Test_Classes`; operations are codes of
/// runtime/Provider_Operations.h.
struct Control {
  /// Forgets what was played and what was asked.
  void (*reset)();
  /// Sets what the provider of a class does with an operation: steps with "; " between them, see
  /// Play.h.
  void (*play)(const char* class_name, std::uint32_t operation, const char* steps);
  /// Lets an operation without steps of its own end with an exception (a kind that `throw` of
  /// Play.h knows) behind its work. Null mends it.
  void (*break_behind)(const char* class_name, std::uint32_t operation, const char* kind);
  /// What the providers were asked and what they saw since the last call, a line each. The text
  /// lives until the next call.
  const char* (*asked)();
  /// How often the provider of a class was called with an operation since the reset.
  std::size_t (*count)(const char* class_name, std::uint32_t operation);
  /// A management interface for letters that have no factory; null for letters that nobody knows.
  void* (*interface)(const char* class_name, const CMPIBroker* broker, const CMPIContext* context,
                     char letter);
};

}  // namespace cimrt::test

/// The one symbol of the test library beside those that every provider library has.
extern "C" [[gnu::visibility("default")]] const cimrt::test::Control* cmpi_test_control() noexcept;
