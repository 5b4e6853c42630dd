#include <algorithm>
#include <cstring>
#include <exception>
#include <memory>

#include "access/TVX_Runtime_Loader.h"
#include "common/CLogger.h"
#include "model/TVX_Data.h"
#include "model/TVX_Guard.h"
#include "model/TVX_Snia.h"

namespace cimrt {

namespace {

constexpr std::uint32_t FIRST_ROWS = 256;  // enough for an ordinary SAN
constexpr std::uint32_t MAX_ROWS = 1U << 20;
constexpr int MAPPING_TRIES = 3;

std::uint32_t entryCount(const TVX_Block& mapping) {
  std::uint32_t count = 0;
  std::memcpy(&count, mapping.get(), sizeof count);
  return count;
}

/// A mapping with room for `rows`, which is set in it; null without memory.
TVX_Block allocateMapping(std::uint32_t rows) {
  if (rows > MAX_ROWS) return nullptr;
  const std::size_t size = offsetof(HBA_FCPTARGETMAPPING, entry) + rows * sizeof(HBA_FCPSCSIENTRY);
  TVX_Block mapping = tvxAllocate(std::max(size, sizeof(HBA_FCPTARGETMAPPING)));
  if (mapping != nullptr) std::memcpy(mapping.get(), &rows, sizeof rows);
  return mapping;
}

}  // namespace

// ---- Port ----

Port::Port(Adapter* adapter) : m_pAdapter(adapter) {}

Port::~Port() noexcept(false) {
  TVX_LOG(TVX_DBG, "~Port");
  freeTargets();
}

void Port::freeTargets() {
  for (Target* target : m_Targets) {
    TVX_LOG(TVX_DBG, "Freeing Target: %s", target->portWWN.c_str());
    freePart(target, "Target deletion failed !!!");
  }
  m_Targets.clear();
}

// ---- FC port ----

FCPort::FCPort(Adapter* adapter, std::uint32_t index) : Port(adapter) {
  TVX_LOG(TVX_DBG, "FCPort::FCPort");
  auto attributes = std::make_unique<FCPortAttributes>(adapter, index);
  m_Name = attributes->PortWWN;
  m_NodeName = attributes->NodeWWN;
  m_Index = index;
  m_pAttributes = attributes.release();
}

FCPort::~FCPort() noexcept(false) {
  TVX_LOG(TVX_DBG, "~FCPort");
  freePart(m_pAttributes, "FC Port attribute deletion failed!!!");
  freePart(m_pStatistics, "FC Port statistics deletion failed!!!");
}

PortStatistics* FCPort::refreshStatistics() {
  PortStatistics* fresh = nullptr;
  try {
    fresh = std::make_unique<FCPortStatistics>(m_Name).release();
  } catch (...) {
    TVX_LOG(TVX_ERR, "FC Port statistics error occurred,retain the old statistics");
    throw;
  }
  freePart(m_pStatistics, "FC Port statistics deletion failed!!!");
  m_pStatistics = fresh;
  return m_pStatistics;
}

Target* FCPort::getTarget(int index) {
  if (index < 0 || static_cast<std::size_t>(index) >= m_Targets.size()) throw std::exception();
  return m_Targets[static_cast<std::size_t>(index)];
}

// ---- Targets ----

void FCPort::rescanTargets(Adapter* adapter) {
  TVX_LOG(TVX_DBG, "FCPort::rescanTargets");
  freeTargets();
  const Snia_Adapter snia(adapter->getName());
  TVX_Block mapping;
  std::uint32_t rows = 0;
  const HBA_STATUS status = getFcpTargetMapping(snia.handle(), mapping, rows);
  if (mapping != nullptr && entryCount(mapping) == 0) {
    TVX_LOG(TVX_DBG, "HBA_GetFcpTargetMapping_t() found no target mappings");
    mapping.reset();
  }
  if (status == HBA_STATUS_OK && mapping != nullptr) buildTargets(adapter, mapping, rows);
}

void FCPort::buildTargets(Adapter* adapter, const TVX_Block& mapping, std::uint32_t rows) {
  const std::uint8_t* const first = mapping.get() + offsetof(HBA_FCPTARGETMAPPING, entry);
  for (std::uint32_t i = 0; i < std::min(entryCount(mapping), rows); ++i) {
    if (adapter->isScanStopped()) return;
    HBA_FCPSCSIENTRY row;
    std::memcpy(&row, first + i * sizeof row, sizeof row);
    try {
      auto target = std::make_unique<Target>(adapter, this, row);
      m_Targets.push_back(target.get());
      static_cast<void>(target.release());
    } catch (...) {
      TVX_LOG(TVX_ERR, "target creation failed - moving to the next target");
    }
  }
}

HBA_STATUS FCPort::getFcpTargetMapping(HBA_HANDLE handle, TVX_Block& mapping, std::uint32_t& rows) {
  rows = FIRST_ROWS;
  HBA_STATUS status = HBA_STATUS_ERROR;
  for (int tries = 0; tries < MAPPING_TRIES; ++tries) {
    TVX_LOG(TVX_DBG, "To retry the HBA_GetFcpTargetMapping command");
    TVX_LOG(TVX_DBG, "Deleting the allocated memory");
    mapping.reset();  // before the next one is asked for: both can be large
    mapping = allocateMapping(rows);
    if (mapping == nullptr) {
      TVX_LOG(TVX_CRIT, "Could not allocate memory..break ");
      return status;
    }
    status =
        HBA_GetFcpTargetMapping(handle, reinterpret_cast<HBA_FCPTARGETMAPPING*>(mapping.get()));
    if (status == HBA_STATUS_OK) {
      TVX_LOG(TVX_DBG, "All Ok ...break ");
      break;
    }
    if (status == HBA_STATUS_ERROR_STALE_DATA) {
      HBA_RefreshInformation(handle);
      TVX_LOG(TVX_DBG, "Refresh and retry ... ");
    } else if (status == HBA_STATUS_ERROR_MORE_DATA) {
      rows = entryCount(mapping);
      TVX_LOG(TVX_DBG, "Increasing the buffer to = %d", static_cast<int>(rows));
    } else {
      mapping.reset();
      TVX_LOG(TVX_ERR, "Error hbaStatus=%d", static_cast<int>(status));
      return status;
    }
  }
  TVX_LOG(TVX_DBG, "Successful target info fetched");
  return status;
}

}  // namespace cimrt
