// The two record logs of a host: the provider's own and the driver's.
//
// Both stand in one map. All of these want the agent's data lock.
#pragma once

#include <string>

#include "agent/ProviderAgent.h"
#include "generated/Records.h"

namespace cimrt {

/// States of a record log.
enum Log_State : std::uint16_t { LOG_ENABLED = 2, LOG_DISABLED = 3, LOG_NO_CHANGE = 5 };

/// `OperationalStatus` of a record log.
enum Log_Status : std::uint16_t { LOG_OK = 2, LOG_STOPPED = 10 };

/// `InstanceID` of the provider's own log.
std::string providerLogInstanceID(ProviderAgent& agent);
/// `InstanceID` and `ElementName` of the driver's log.
std::string driverLogInstanceID(ProviderAgent& agent);

/// The log of that `InstanceID`, owned by its map, or null.
TVXHBA_RecordLog* findRecordLog(ProviderAgent& agent, const std::string& instanceID);

}  // namespace cimrt
