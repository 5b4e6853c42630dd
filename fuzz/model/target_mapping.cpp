// A library may tell of any rows, in any number and with any status: there is a target for each row
// that fits into the room it was told, and for no other. Of the input, each call takes a status and
// a count; the rest fills the rows.
#include <algorithm>
#include <cstring>

#include "../runtime/Expect.h"
#include "Fake_Host.h"
#include "model/TVX_Data.h"

namespace cimrt {
namespace {

constexpr HBA_STATUS STATUSES[] = {HBA_STATUS_OK, HBA_STATUS_ERROR_MORE_DATA,
                                   HBA_STATUS_ERROR_STALE_DATA, HBA_STATUS_ERROR};
constexpr std::uint32_t MOST_ROWS = 400;  // more would only cost time

/// What is left of the input.
struct Input {
  const std::uint8_t* data = nullptr;
  std::size_t size = 0;

  std::uint32_t take(std::size_t bytes) {
    std::uint32_t value = 0;
    const std::size_t count = std::min(bytes, size);
    std::memcpy(&value, data, count);
    data += count;
    size -= count;
    return value;
  }
  void fill(void* place, std::size_t room) const { std::memcpy(place, data, std::min(room, size)); }
};

Input input;
std::uint32_t told = 0;      // room of the last call
std::uint32_t answered = 0;  // count that it left
HBA_STATUS lastStatus = 0;

HBA_STATUS map(HBA_FCPTARGETMAPPING* out) {
  told = out->NumberOfEntries;
  lastStatus = STATUSES[input.take(1) % 4];
  answered = input.take(2);
  if (answered > MOST_ROWS && lastStatus == HBA_STATUS_ERROR_MORE_DATA) answered |= 0xFFF00000;
  input.fill(out->entry, told * sizeof(HBA_FCPSCSIENTRY));
  out->NumberOfEntries = answered;
  return lastStatus;
}

struct Host {
  Host() {
    host.add("Torvex-F0", 1);
    host.libraries.provide(HBA_GetFcpTargetMapping,
                           [](HBA_HANDLE, HBA_FCPTARGETMAPPING* out) { return map(out); });
    host.libraries.provide(HBA_SendScsiInquiry,
                           [](HBA_HANDLE, HBA_WWN, HBA_UINT64, HBA_UINT8, HBA_UINT32, void*,
                              HBA_UINT32, void*, HBA_UINT32) { return HBA_STATUS{1}; });
    host.libraries.provide(HBA_SendReadCapacity,
                           [](HBA_HANDLE, HBA_WWN, HBA_UINT64, void*, HBA_UINT32, void*,
                              HBA_UINT32) { return HBA_STATUS{1}; });
    data.buildAdapterData();
  }
  tvx::test::Fake_Host host;
  Data data;
};

}  // namespace
}  // namespace cimrt

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  using namespace cimrt;
  static Host host;
  input = {data, size};
  host.data.buildSANData();
  const Port& port = *host.data.m_Ports.at(0);
  const std::uint32_t wanted = lastStatus == HBA_STATUS_OK ? std::min(told, answered) : 0;
  fuzz::expect(port.m_Targets.size() == wanted && host.host.open == 0);
  for (const Target* target : port.m_Targets) {
    fuzz::expect(target->portWWN.size() == 16 && target->nodeWWN.size() == 16);
    fuzz::expect(target->osDeviceName.size() <= 256 && target->vendor == "Unknown");
  }
  return 0;
}
