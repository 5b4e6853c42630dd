// The nine diagnostic tests of an FC port, as one table that everything else is driven by.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <initializer_list>
#include <span>

namespace cimrt {

/// What tells the tests apart. The values are the tests' numbers.
enum class Diagnostic_Test : std::uint32_t {
  BEACON = 1,
  ECHO = 2,
  EXTERNAL_LOOPBACK = 3,
  HOST_LOOPBACK = 4,
  INTERNAL_LOOPBACK = 5,
  PING = 6,
  RESET = 7,
  SELF = 8,
  STATUS = 9,
};

/// Names of the tests: of their instances, and of all that belongs to them.
inline constexpr const char* BEACON_TEST = "TVX:FCHBA Beacon Test";
inline constexpr const char* ECHO_TEST = "TVX:FCHBA Echo Test";
inline constexpr const char* EXTERNAL_LOOPBACK_TEST = "TVX:FCHBA External Loopback Test";
inline constexpr const char* HOST_LOOPBACK_TEST = "TVX:FCHBA Host Loopback Test";
inline constexpr const char* INTERNAL_LOOPBACK_TEST = "TVX:FCHBA Internal Loopback Test";
inline constexpr const char* PING_TEST = "TVX:FCHBA Ping Test";
inline constexpr const char* STATUS_TEST = "TVX:FCHBA Status Test";
inline constexpr const char* RESET_TEST = "TVX:FCHBA Reset Test";
inline constexpr const char* SELF_TEST = "TVX:FCHBA Self Test";

/// A short list inside a table.
template <class T>
class Short_List {
 public:
  constexpr Short_List(std::initializer_list<T> items) {
    for (const T& item : items) m_Items[m_Size++] = item;
  }
  constexpr const T* begin() const { return m_Items.data(); }
  constexpr const T* end() const { return begin() + m_Size; }
  constexpr std::size_t size() const { return m_Size; }
  constexpr bool empty() const { return m_Size == 0; }

 private:
  static constexpr std::size_t ROOM = 5;
  std::array<T, ROOM> m_Items{};
  std::size_t m_Size = 0;
};

/// Whether a test stops at its first error.
enum class Halt_On_Error { NO, YES, UNSET };

/// One test. An empty list leaves its property unset.
struct Diagnostic_Row {
  Diagnostic_Test number;
  const char* name;
  std::uint16_t type;  ///< `FCHBATestType`
  const char* description;
  Short_List<std::uint16_t> testTypes;
  Short_List<std::uint16_t> characteristics;
  Short_List<std::uint16_t> loopControl;
  Short_List<const char*> loopControlParameter;
  Halt_On_Error haltOnError;
  Short_List<std::uint16_t> supportedLoopControl;
  Short_List<std::uint16_t> supportedExecutionControls;
  Short_List<const char*> otherExecutionControls;

  /// True for the tests that send a pattern, in cycles: loopbacks, ping and echo.
  bool sendsPattern() const;
  /// True for the tests that need a target device: ping and echo.
  bool needsTarget() const;
};

/// The tests, in the order in which their instances are made.
std::span<const Diagnostic_Row> diagnosticTests();
/// The test of exactly that name, or null.
const Diagnostic_Row* findDiagnosticTest(const char* name);

}  // namespace cimrt
