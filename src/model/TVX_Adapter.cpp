#include <algorithm>
#include <memory>
#include <stdexcept>

#include "common/CLogger.h"
#include "model/TVX_Data.h"
#include "model/TVX_Guard.h"

namespace cimrt {

namespace {

/// More ports than an adapter can truly have.
constexpr std::uint32_t MAX_PORTS = 1024;

}  // namespace

Adapter::Adapter() = default;

Adapter::Adapter(const std::string& name, std::int32_t number, std::int32_t type)
    : m_Name(name), m_Number(number), m_Type(type) {
  TVX_LOG(TVX_DBG, "Adapter( adapterName[%s], adapterNumber[%d], adapterType[%d] )", name.c_str(),
          number, type);
}

Adapter::Adapter(const Adapter& other)
    : m_pAttributes(other.m_pAttributes),
      m_Ports(other.m_Ports),
      m_Name(other.m_Name),
      m_Number(other.m_Number),
      m_Type(TVX_ADAPTER_TYPE_FC) {}

Adapter::~Adapter() noexcept(false) {
  TVX_LOG(TVX_DBG, "~Adapter");
}

FCAdapter::FCAdapter(const std::string& name, std::int32_t number)
    : Adapter(name, number, TVX_ADAPTER_TYPE_FC) {
  auto attributes = std::make_unique<FCAdapterAttributes>(this);
  m_FunctionType = attributes->FunctionType;
  auto statistics = std::make_unique<FCAdapterStatistics>(this);
  const std::uint32_t count = std::min(attributes->NumberOfPorts, MAX_PORTS);
  m_Ports.reserve(count);
  // From here on nothing throws: an adapter that is not built is not destroyed either.
  m_pStatistics = statistics.release();
  m_pAttributes = attributes.release();
  buildPorts(count);
}

void FCAdapter::buildPorts(std::uint32_t count) {
  for (std::uint32_t index = 0; index < count; ++index) {
    try {
      m_Ports.push_back(std::make_unique<FCPort>(this, index).release());
    } catch (...) {
      TVX_LOG(TVX_ERR, "Failed to fetch information for port: [%d] on adapter: [%s]",
              static_cast<int>(index), m_Name.c_str());
    }
  }
}

FCAdapter::~FCAdapter() noexcept(false) {
  TVX_LOG(TVX_DBG, "~FCAdapter");
  freePart(m_pAttributes, "Adapter attribute delete failed");
  freePart(m_pStatistics, "Adapter statistics delete failed");
  for (Port* port : m_Ports) {
    TVX_LOG(TVX_DBG, "Freeing Port: %s", port->m_Name.c_str());
    freePart(port, "Error in port freeing");
  }
  m_Ports.clear();
}

Port* FCAdapter::getPort(int index) {
  if (index < 0 || static_cast<std::size_t>(index) >= m_Ports.size()) {
    throw std::out_of_range("vector::_M_range_check");
  }
  return m_Ports[static_cast<std::size_t>(index)];
}

void FCAdapter::rescanTargets() {
  TVX_LOG(TVX_DBG, "FCAdapter::rescanTargets");
  for (Port* port : m_Ports) {
    if (isScanStopped()) return;
    try {
      port->rescanTargets(this);
    } catch (...) {
      TVX_LOG(TVX_ERR, "Issue with Target Rescan - moving to the next Port");
    }
  }
}

}  // namespace cimrt
