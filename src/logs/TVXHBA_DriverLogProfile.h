// The driver's record log as the refresh builds it.
#pragma once

#include "agent/MapBuild.h"

namespace cimrt {

class TVXHBA_DriverLogProfile {
 public:
  explicit TVXHBA_DriverLogProfile(ProviderAgent& agent);
  ~TVXHBA_DriverLogProfile();
  TVXHBA_DriverLogProfile(const TVXHBA_DriverLogProfile&) = delete;
  TVXHBA_DriverLogProfile& operator=(const TVXHBA_DriverLogProfile&) = delete;

  /// Makes the log, its capabilities and its tie to the driver's identity, for the first FC adapter
  /// alone: a host has one driver log. It stands as disabled until a client enables it. Runs on the
  /// refresh thread with the agent's map and data locks held.
  /// @return 0, also without an FC adapter, or MAP_BUILD_FAILED with the failure logged
  std::int32_t CreateFCDriverLogClasses();

 private:
  std::int32_t createFor(const FCAdapterAttributes& attributes);
  TVXHBA_RecordLog* createLog();
  bool createCapabilities();
  bool tieToDriver(const TVXHBA_RecordLog* log, const FCAdapterAttributes& attributes);

  ProviderAgent& m_Agent;
};

}  // namespace cimrt
