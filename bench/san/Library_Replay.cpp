#include "Library_Replay.h"

#include <cstring>
#include <string>
#include <vector>

#include "access/TVX_Runtime_Loader.h"
#include "model/TVX_Target.h"
#include "rmapi/rmapi.h"

namespace tvx::bench {

namespace {

constexpr std::uint32_t FIRST_ROWS = 256;

/// The mapping, read twice if it has more rows than the first buffer.
std::vector<std::uint8_t> readMapping(HBA_HANDLE handle) {
  std::vector<std::uint8_t> buffer;
  std::uint32_t rows = FIRST_ROWS;
  for (HBA_STATUS status = HBA_STATUS_ERROR_MORE_DATA; status == HBA_STATUS_ERROR_MORE_DATA;) {
    buffer.assign(offsetof(HBA_FCPTARGETMAPPING, entry) + rows * sizeof(HBA_FCPSCSIENTRY), 0);
    std::memcpy(buffer.data(), &rows, sizeof rows);
    status = cimrt::HBA_GetFcpTargetMapping(handle,
                                            reinterpret_cast<HBA_FCPTARGETMAPPING*>(buffer.data()));
    std::memcpy(&rows, buffer.data(), sizeof rows);
  }
  return buffer;
}

void askUnit(std::string& adapter, const HBA_FCPSCSIENTRY& row) {
  std::uint8_t response[cimrt::TVX_SCSI_RESPONSE_SIZE];
  std::uint8_t sense[cimrt::TVX_SCSI_SENSE_SIZE];
  const HBA_HANDLE handle = cimrt::HBA_OpenAdapter(adapter.data());
  for (const HBA_UINT32 page : {0U, 0x80U, 0x83U})
    cimrt::HBA_SendScsiInquiry(handle, row.FcpId.PortWWN, row.FcpId.FcpLun, page != 0, page,
                               response, sizeof response, sense, sizeof sense);
  cimrt::HBA_SendReadCapacity(handle, row.FcpId.PortWWN, row.FcpId.FcpLun, response,
                              sizeof response, sense, sizeof sense);
  cimrt::HBA_CloseAdapter(handle);
}

}  // namespace

std::size_t replayScan() {
  char name[256] = {};
  cimrt::HBA_GetAdapterName(0, name);
  std::string adapter = name;
  const HBA_HANDLE handle = cimrt::HBA_OpenAdapter(adapter.data());
  const std::vector<std::uint8_t> mapping = readMapping(handle);
  std::uint32_t rows = 0;
  std::memcpy(&rows, mapping.data(), sizeof rows);
  for (std::uint32_t i = 0; i < rows; i++) {
    HBA_FCPSCSIENTRY row;
    std::memcpy(&row, mapping.data() + offsetof(HBA_FCPTARGETMAPPING, entry) + i * sizeof row,
                sizeof row);
    askUnit(adapter, row);
  }
  cimrt::HBA_CloseAdapter(handle);
  return rows;
}

}  // namespace tvx::bench
