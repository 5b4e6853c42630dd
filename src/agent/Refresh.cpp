// When the cache is rebuilt, and the thread that rebuilds it.
#include <cerrno>
#include <new>

#include "agent/ProviderAgent.h"
#include "common/TVX_Clock.h"
#include "model/TVX_Data.h"

namespace cimrt {

namespace {

constexpr std::uint32_t USEC_PER_MINUTE = 60'000'000;

/// Marks a group of data as being built and, at the end of its scope, as ready, whatever happened
/// in between, and wakes everybody who waits for it. The group's mutex is held throughout.
class Building {
 public:
  Building(std::atomic<bool>& building, std::atomic<bool>& ready, Ranked_Cond& cond)
      : m_Building(building), m_Ready(ready), m_Cond(cond) {
    m_Building = true;
  }
  ~Building() {
    m_Ready = true;
    m_Building = false;
    m_Cond.broadcast();
  }
  Building(const Building&) = delete;
  Building& operator=(const Building&) = delete;

 private:
  std::atomic<bool>& m_Building;
  std::atomic<bool>& m_Ready;
  Ranked_Cond& m_Cond;
};

/// Runs one build. What it throws ends the build and nothing else: readers get what there is.
template <class Build>
void contain(const char* what, Build build) {
  try {
    build();
  } catch (...) {
    TVX_LOG(TVX_CRIT, "Exception in %s - do nothing", what);
  }
}

}  // namespace

bool ProviderAgent::isTimeOut() const {
  TVX_LOG(TVX_DBG, "Checking if TimeOut...");
  const Datetime now = tvxNowDatetime();
  char loadedText[Datetime::ASCII_SIZE];
  char nowText[Datetime::ASCII_SIZE];
  m_LoadedTime.ascii(loadedText, false);
  now.ascii(nowText, false);
  const std::uint32_t timeout = m_CacheTimeout;
  TVX_LOG(TVX_DBG, "loadedtime = %s; currenttime = %s; cache timeout = %d", loadedText, nowText,
          static_cast<int>(timeout));
  const std::uint32_t limit = timeout * USEC_PER_MINUTE;
  const bool timedOut = now.usec() - m_LoadedTime.usec() >= limit;
  TVX_LOG(TVX_DBG, timedOut ? "PERF: TimeOut" : "PERF: Refresh Not yet required");
  return timedOut;
}

std::int32_t ProviderAgent::BuildCimrtInfo() {
  TVX_LOG(TVX_INFO, " Entering BuildCimrtInfo()");
  if (!m_bLoaded)
    TVX_LOG(TVX_DBG,
            "Torvex Provider dependent library load has failed..do nothing is the only option");
  Ranked_Lock thread(m_ThreadMutex);
  if (!isTimeOut() && !m_bAdapterRefreshPending && !m_bSANRefreshPending) {
    TVX_LOG(TVX_DBG, "PERF: ---No timeout BuildCimrtInfo END---");
    return 0;
  }
  if (m_bThreadRunning) {
    TVX_LOG(TVX_DBG, "DataFetch_Handler thread already running-BuildCimrtInfo");
    return 0;
  }
  m_bThreadRunning = true;
  joinRefreshThread();
  if (!m_bSANRefreshPending) m_bAdapterRefreshPending = true;
  if (startRefreshThread()) return 0;
  // Without a thread the work is done here: readers that wait must not wait for ever.
  thread.release();
  DataFetch_Handler(this);
  return 0;
}

void ProviderAgent::joinRefreshThread() {
  if (!m_bThreadJoinable) return;
  TVX_LOG(TVX_DBG, "PERF: Clearing the previous thread...with join");
  void* result = nullptr;
  Thread::join(m_Thread, result);
  m_bThreadJoinable = false;
}

bool ProviderAgent::startRefreshThread() {
  int status = ENOMEM;
  try {
    status = Thread::create_joinable(m_Thread, DataFetch_Handler, this);
  } catch (const std::bad_alloc&) {
    // As if the system had refused it.
  }
  if (status != 0) {
    TVX_LOG(TVX_CRIT, "DataFetch_Handler thread could not be created");
    return false;
  }
  m_bThreadJoinable = true;
  TVX_LOG(TVX_DBG, "PERF: ---Created DataFetch_Handler thread -- BuildCimrtInfo END---");
  return true;
}

void* ProviderAgent::DataFetch_Handler(void* agent) {
  TVX_LOG(TVX_DBG, "PERF: DataFetch_Handler Thread BEGIN");
  if (agent) static_cast<ProviderAgent*>(agent)->runStages();
  TVX_LOG(TVX_DBG, "PERF: DataFetch_Handler Thread END");
  return nullptr;
}

void ProviderAgent::runStages() {
  if (m_bAdapterRefreshSetting || m_bAdapterRefreshPending) {
    buildAdapterTree();
    rebuildAdapterMaps();
  }
  if (m_bSANRefreshSetting || m_bSANRefreshPending) runSANStage();
  while (!finishRun()) runSANStage();
  announceEndOfRun();
}

void ProviderAgent::buildAdapterTree() {
  TVX_LOG(TVX_DBG, "PERF: Building Adapter Data...");
  Ranked_Lock dataReady(m_AdapterDataReadyMutex);
  m_bAdapterRefreshPending = false;
  m_bIsAdapterDataReady = false;
  m_bIsAdapterMapsReady = false;
  Building building(m_bIsAdapterDataBuilding, m_bIsAdapterDataReady, m_AdapterDataReadyCond);
  if (!m_bLoaded) return;
  Ranked_Lock data(m_DataMutex);
  contain("buildAdapterData", [this] { m_pData->buildAdapterData(); });
}

void ProviderAgent::rebuildAdapterMaps() {
  {
    // Their owners are gone: what the SAN maps hold is stale from here on.
    Ranked_Lock sanReady(m_SANMapsReadyMutex);
    m_bIsSANMapsReady = false;
  }
  Ranked_Lock mapsReady(m_AdapterMapsReadyMutex);
  Building building(m_bIsAdapterMapsBuilding, m_bIsAdapterMapsReady, m_AdapterMapsReadyCond);
  if (!m_bLoaded) return;
  TVX_LOG(TVX_DBG, "PERF: Updating Adapter Maps...");
  Ranked_Lock data(m_DataMutex);
  contain("updateAdapterMaps", [this] { updateAdapterMaps(); });
}

void ProviderAgent::runSANStage() {
  Ranked_Lock dataReady(m_AdapterDataReadyMutex);
  m_bSANRefreshPending = false;
  m_bIsSANMapsReady = false;
  // The device tree and the adapter maps are ready: this thread alone builds them, and its first
  // run always does. There is nobody to wait for.
  rebuildSANTargets();
  Ranked_Lock mapsReady(m_AdapterMapsReadyMutex);
  Ranked_Lock sanReady(m_SANMapsReadyMutex);
  rebuildSANMaps();
  // Whoever asked while the stage ran gets its result.
  m_bSANRefreshPending = false;
}

void ProviderAgent::rebuildSANTargets() {
  if (!m_bLoaded) return;
  Ranked_Lock data(m_DataMutex);
  TVX_LOG(TVX_DBG, "PERF: Building SAN Data...");
  contain("buildSANData", [this] { m_pData->buildSANData(); });
}

void ProviderAgent::rebuildSANMaps() {
  Building building(m_bIsSANMapsBuilding, m_bIsSANMapsReady, m_SANMapsReadyCond);
  if (!m_bLoaded) return;
  Ranked_Lock data(m_DataMutex);
  TVX_LOG(TVX_DBG, "PERF: Updating SAN Maps...");
  contain("updateSANMaps", [this] { updateSANMaps(); });
}

bool ProviderAgent::finishRun() {
  Ranked_Lock thread(m_ThreadMutex);
  // A SAN reader that came after the stages were decided found the thread running and left the
  // work to it.
  if (m_bSANRefreshPending) return false;
  m_bThreadRunning = false;
  // Without memory for the time the old one stays, and the next reader asks for a run again.
  contain("DataFetch_Handler", [this] { m_LoadedTime = tvxNowDatetime(); });
  return true;
}

void ProviderAgent::announceEndOfRun() {
  Ranked_Lock sanReady(m_SANMapsReadyMutex);
  m_EndedRuns++;
  m_SANMapsReadyCond.broadcast();
}

}  // namespace cimrt
