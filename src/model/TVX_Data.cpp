// The root of the device tree and the discovery of adapters.
#include "model/TVX_Data.h"

#include <algorithm>
#include <array>
#include <memory>

#include "access/TVX_Runtime_Loader.h"
#include "common/CLogger.h"

namespace cimrt {

namespace {

/// More adapters than a library can truly have.
constexpr std::uint32_t MAX_ADAPTERS = 1024;
constexpr std::size_t NAME_SIZE = 256;

/// Adapters of these names are not served.
bool isForeignAdapter(const std::string& name) {
  return name.starts_with("Torvex-O") || name.starts_with("Torvex-N");
}

/// Function types 1, 2 and 3 are not FC functions.
bool isFCFunction(std::uint32_t functionType) {
  return functionType < 1 || functionType > 3;
}

bool readAdapterName(std::uint32_t index, std::string& name) {
  std::array<char, 4 * NAME_SIZE> buffer{};  // more room than the longest name of the API
  const HBA_STATUS status = HBA_GetAdapterName(index, buffer.data());
  if (status != HBA_STATUS_OK) {
    TVX_LOG(TVX_WARN, "Error hbaStatus = %d, Skipping Adapter# %u", static_cast<int>(status),
            index);
    return false;
  }
  buffer[NAME_SIZE - 1] = '\0';
  name = buffer.data();
  return true;
}

/// Deletes an adapter. The destructors of its parts may throw.
void freeAdapter(Adapter* adapter) {
  TVX_LOG(TVX_DBG, "Freeing adapter: %s", adapter->getName().c_str());
  try {
    delete adapter;
  } catch (...) {
    TVX_LOG(TVX_DBG, "Error in freeAllData -- do nothing");
  }
}

}  // namespace

Data::Data() {
  HBA_LoadLibrary();
  TVX_LOG(TVX_DBG, "Data Pointer Constructed.");
}

Data::~Data() {
  freeAllData();
  TVX_LOG(TVX_DBG, "Data Pointer deleted.");
}

void Data::freeAllData() {
  TVX_LOG(TVX_DBG, "freeAllData: Entry");
  m_Ports.clear();
  for (Adapter* adapter : m_Adapters) freeAdapter(adapter);
  m_Adapters.clear();
  m_AdapterCount = 0;
  m_bFCCardFound = false;
  TVX_LOG(TVX_DBG, "freeAllData: cleanExit");
}

void Data::buildAdapterData() {
  TVX_LOG(TVX_DBG, "buildAdapterData");
  freeAllData();
  TVX_LOG(TVX_DBG, "buildAdapterData - with hbaapi");
  m_AdapterCount = std::min<std::uint32_t>(HBA_GetNumberOfAdapters(), MAX_ADAPTERS);
  const std::uint32_t count = m_AdapterCount;
  TVX_LOG(TVX_DBG, "Number of Adapters detected = %u", count);
  if (count == 0) {
    TVX_LOG(TVX_CRIT, "HBAAPI reports that there are NO HBAs in the system.");
    return;
  }
  for (std::uint32_t index = 0; index < count; ++index) buildAdapter(index);
}

void Data::buildAdapter(std::uint32_t index) {
  std::string name;
  if (!readAdapterName(index, name) || isForeignAdapter(name)) {
    --m_AdapterCount;
    return;
  }
  TVX_LOG(TVX_DBG, "FC AdapterName : [%s]", name.c_str());
  std::unique_ptr<Adapter> adapter;
  try {
    adapter = std::make_unique<FCAdapter>(name, static_cast<std::int32_t>(index));
  } catch (...) {
    TVX_LOG(TVX_ERR, "Catch ALL error during creating adapter..., Skipping Adapter# %d",
            static_cast<int>(index));
    --m_AdapterCount;
    return;
  }
  TVX_LOG(TVX_DBG, "Adapter Function type : %d", static_cast<int>(adapter->getFunctionType()));
  if (!isFCFunction(adapter->getFunctionType())) {
    --m_AdapterCount;
    return;
  }
  keepAdapter(adapter.release());
}

void Data::keepAdapter(Adapter* adapter) {
  adapter->m_pScanStopped = &m_bScanStopped;
  m_Adapters.push_back(adapter);
  m_bFCCardFound = true;
  m_Ports.insert(m_Ports.end(), adapter->m_Ports.begin(), adapter->m_Ports.end());
}

void Data::buildSANData() {
  TVX_LOG(TVX_DBG, "buildSANData");
  for (Adapter* adapter : m_Adapters) {
    if (m_bScanStopped) return;
    TVX_LOG(TVX_DBG, "Target Scan from adapter: %s", adapter->getName().c_str());
    try {
      adapter->rescanTargets();
    } catch (...) {
      TVX_LOG(TVX_ERR, "Issue with Target Rescan with Adapter- moving to the next adapter");
    }
  }
}

}  // namespace cimrt
