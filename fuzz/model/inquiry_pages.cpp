// A unit may answer anything to the four commands of a scan: a target and its texts are made of it
// all the same, within the answer. The input is shared out to the answers, 255 bytes each.
#include <algorithm>
#include <cstring>
#include <map>

#include "../runtime/Expect.h"
#include "Fake_Host.h"
#include "agent/SanTexts.h"
#include "model/TVX_Data.h"

namespace cimrt {
namespace {

constexpr std::size_t ANSWER = TVX_SCSI_RESPONSE_SIZE;

const std::uint8_t* input = nullptr;
std::size_t inputSize = 0;

/// The first byte of an answer decides whether there is one.
HBA_STATUS answer(std::size_t command, void* response, HBA_UINT32 size) {
  const std::size_t begin = std::min(command * (ANSWER + 1), inputSize);
  const std::size_t end = std::min(begin + ANSWER + 1, inputSize);
  if (begin == end) return HBA_STATUS_SCSI_CHECK_CONDITION;
  const HBA_STATUS status = input[begin] % 4 == 3 ? input[begin] : HBA_STATUS_OK;
  std::memcpy(response, input + begin + 1, std::min<std::size_t>(end - begin - 1, size));
  return status;
}

/// A host with one port, behind which one unit lies.
struct Host {
  Host() {
    host.add("Torvex-F0", 1);
    host.libraries.provide(HBA_GetFcpTargetMapping, [](HBA_HANDLE, HBA_FCPTARGETMAPPING* out) {
      out->NumberOfEntries = 1;
      out->entry[0] = {};
      return HBA_STATUS{0};
    });
    host.libraries.provide(HBA_SendScsiInquiry,
                           [](HBA_HANDLE, HBA_WWN, HBA_UINT64, HBA_UINT8, HBA_UINT32 page,
                              void* response, HBA_UINT32 size, void*, HBA_UINT32) {
                             return answer(page == 0 ? 0 : page == 0x80 ? 1 : 2, response, size);
                           });
    host.libraries.provide(HBA_SendReadCapacity,
                           [](HBA_HANDLE, HBA_WWN, HBA_UINT64, void* response, HBA_UINT32 size,
                              void*, HBA_UINT32) { return answer(3, response, size); });
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
  input = data;
  inputSize = size;
  host.data.buildSANData();
  Port& port = *host.data.m_Ports.at(0);
  fuzz::expect(port.getNumberOfTargets() == 1 && host.host.open == 0);
  const Target& target = *port.getTarget(0);
  fuzz::expect(target.deviceType <= 0x1F && target.serialNumber.size() <= ANSWER - 4);
  fuzz::expect(target.vendor.size() <= 8 && target.model.size() <= 16);
  const DeviceIdentification& id = target.deviceIdentification;
  fuzz::expect(id.identifierLength <= 255 && id.identifierType <= 15);
  const Unit_Texts texts = unitTexts(port.m_Name, target);
  fuzz::expect(texts.lun.size() == 16 && texts.identifier.size() <= 32);
  fuzz::expect(texts.inquiry.size() <= 8 + 1 + 16 + 10 + 4);
  fuzz::expect(deviceName(id, texts.identifier).size() <= 2 * id.identifier.size());
  return 0;
}
