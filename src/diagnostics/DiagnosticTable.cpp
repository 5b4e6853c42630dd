#include "diagnostics/DiagnosticTable.h"

#include <cstring>

namespace cimrt {

namespace {

// Values of the properties, as the schema numbers them.
constexpr std::uint16_t NOT_SUPPORTED = 0x8000;

// clang-format off
constexpr Diagnostic_Row TESTS[] = {
    {Diagnostic_Test::BEACON, BEACON_TEST, 2,
     "Test causes a port's LEDs to flash on and off, allowing the port to be easily visually identified",
     {2}, {0}, {3}, {"5"}, Halt_On_Error::NO, {3, 4}, {NOT_SUPPORTED}, {}},
    {Diagnostic_Test::ECHO, ECHO_TEST, 3,
     "Test verifies the data path from host to target",
     {3, 5}, {4, 10}, {3}, {"100"}, Halt_On_Error::NO, {3}, {1},
     {"TargetDevice", "EchoMechanism", "LUN", "BufferSize", "BufferPattern"}},
    {Diagnostic_Test::EXTERNAL_LOOPBACK, EXTERNAL_LOOPBACK_TEST, 4,
     "Test verifies that the entire data path through an FCHBA is working properly",
     {2, 5}, {4, 10}, {3}, {"100"}, Halt_On_Error::NO, {2, 3}, {1},
     {"BufferSize", "BufferPattern"}},
    {Diagnostic_Test::HOST_LOOPBACK, HOST_LOOPBACK_TEST, 5,
     "Test verifies the FC HBA hostbus interface",
     {2}, {4}, {3}, {"100"}, Halt_On_Error::NO, {2, 3}, {1},
     {"BufferSize", "BufferPattern"}},
    {Diagnostic_Test::INTERNAL_LOOPBACK, INTERNAL_LOOPBACK_TEST, 6,
     "Test verifies the integrity of internal data paths in the FCHBA",
     {2}, {4}, {3}, {"100"}, Halt_On_Error::NO, {2, 3}, {1},
     {"BufferSize", "BufferPattern"}},
    {Diagnostic_Test::PING, PING_TEST, 7,
     "Test verifies the existence and accessibility of devices on the SAN",
     {5}, {4, 10}, {3}, {"100"}, Halt_On_Error::NO, {3}, {1},
     {"TargetDevice", "PingMechanism", "LUN", "BufferSize", "BufferPattern"}},
    {Diagnostic_Test::STATUS, STATUS_TEST, 10,
     "Test checks the health of the FCHBA, not including the FC optics",
     {4}, {0}, {}, {}, Halt_On_Error::NO, {NOT_SUPPORTED}, {NOT_SUPPORTED}, {}},
    {Diagnostic_Test::RESET, RESET_TEST, 8,
     "Test causes the FCHBA to re-initialize itself",
     {2}, {4}, {}, {}, Halt_On_Error::NO, {NOT_SUPPORTED}, {NOT_SUPPORTED}, {}},
    {Diagnostic_Test::SELF, SELF_TEST, 9,
     "Test allows all components of the FCHBA to be tested",
     {2}, {4}, {}, {}, Halt_On_Error::NO, {NOT_SUPPORTED}, {NOT_SUPPORTED}, {}},
};
// clang-format on

}  // namespace

bool Diagnostic_Row::sendsPattern() const {
  return number >= Diagnostic_Test::ECHO && number <= Diagnostic_Test::PING;
}

bool Diagnostic_Row::needsTarget() const {
  return number == Diagnostic_Test::ECHO || number == Diagnostic_Test::PING;
}

std::span<const Diagnostic_Row> diagnosticTests() {
  return TESTS;
}

const Diagnostic_Row* findDiagnosticTest(const char* name) {
  for (const Diagnostic_Row& row : TESTS)
    if (std::strcmp(row.name, name) == 0) return &row;
  return nullptr;
}

}  // namespace cimrt
