#include "model/TVX_Snia.h"

#include <exception>

#include "access/TVX_MethodWrapper.h"
#include "common/CLogger.h"

namespace cimrt {

namespace {

/// Calls until the data are not stale, at most twice.
template <class Record, class Call>
HBA_STATUS readFresh(HBA_HANDLE handle, Record& record, const Call& call) {
  record = {};
  const HBA_STATUS status = call(record);
  if (status != HBA_STATUS_ERROR_STALE_DATA) return status;
  HBA_RefreshInformation(handle);
  record = {};
  return call(record);
}

}  // namespace

Snia_Adapter::Snia_Adapter(const std::string& name) {
  std::string writable = name;  // the API takes the name without const
  m_Handle = HBA_OpenAdapter(writable.data());
  if (m_Handle != 0) return;
  TVX_LOG(TVX_ERR, "HBA_OpenAdapter failed, skipping Adapter %s", name.c_str());
  throw std::exception();
}

Snia_Adapter::~Snia_Adapter() {
  HBA_CloseAdapter(m_Handle);
}

HBA_STATUS Snia_Adapter::attributes(HBA_ADAPTERATTRIBUTES& record) const {
  return readFresh(m_Handle, record, [&](HBA_ADAPTERATTRIBUTES& out) {
    return HBA_GetAdapterAttributes(m_Handle, &out);
  });
}

HBA_STATUS Snia_Adapter::portAttributes(std::uint32_t index, HBA_PORTATTRIBUTES& record) const {
  return readFresh(m_Handle, record, [&](HBA_PORTATTRIBUTES& out) {
    return HBA_GetAdapterPortAttributes(m_Handle, index, &out);
  });
}

HBA_WWN portNameToWWN(const std::string& name) {
  HBA_WWN wwn{};
  if (TVX_MethodWrapper::string2HBAName(&wwn, name.c_str()) != 0) return wwn;
  TVX_LOG(TVX_ERR, "TVX_MethodWrapper::string2HBAName failed");
  throw std::exception();
}

}  // namespace cimrt
