// What the driver has written to the system log.
#include "agent/ProviderAgent.h"
#include "common/TVX_Line_Scan.h"
#include "common/TVX_Path.h"

namespace cimrt {

namespace {

constexpr const char* DRIVER_NAME = "tvfc";

}  // namespace

void ProviderAgent::readDriverLog() {
  TVX_LOG(TVX_DBG, "Reading Events for %s", DRIVER_NAME);
  const std::deque<std::string> lines =
      tvxLastLinesWith(tvxPath(SYSTEM_LOG_PATH).c_str(), DRIVER_NAME, Device_Log_Buffer::CAPACITY);
  for (auto line = lines.rbegin(); line != lines.rend() && m_DeviceLogBuffer.add(*line); ++line) {
  }
  TVX_LOG(TVX_DBG, "Finished reading Events for %s", DRIVER_NAME);
  TVX_LOG(TVX_DBG, "Logging of FC Driver Log Ends");
}

}  // namespace cimrt
