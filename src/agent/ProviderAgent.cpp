// The agent's life: the singleton and its count, construction and destruction step by step.
#include "agent/ProviderAgent.h"

#include <unistd.h>

#include "access/TVX_MethodWrapper.h"
#include "access/TVX_Runtime_Loader.h"
#include "agent/Signal_Trace.h"
#include "common/TVX_Common.h"
#include "common/TVX_Path.h"
#include "model/TVX_Data.h"

namespace cimrt {

std::atomic<ProviderAgent*> ProviderAgent::m_pInstance{nullptr};
std::uint32_t ProviderAgent::m_RefCount = 0;
Lasting<Ranked_Mutex> ProviderAgent::m_InstanceMutex{Lock_Rank::INSTANCE};

/// Destroys, when the module leaves the process, an agent that nobody counts: one whose libraries
/// did not open, so that every `load` was refused. Nobody can be using it by then.
struct Unreferenced_Agent {
  ~Unreferenced_Agent() {
    Ranked_Lock instance(*ProviderAgent::m_InstanceMutex);
    if (ProviderAgent::m_RefCount == 0) delete ProviderAgent::m_pInstance.exchange(nullptr);
  }
};

// --- The singleton -------------------------------------------------------------------------------

ProviderAgent* ProviderAgent::instanceLocked() {
  ProviderAgent* agent = m_pInstance;
  if (agent) return agent;
  agent = new ProviderAgent;
  // Made after everything the constructor used, and so destroyed before it.
  static const Unreferenced_Agent guard;
  m_pInstance = agent;
  return agent;
}

ProviderAgent* ProviderAgent::getInstance() {
  if (ProviderAgent* agent = m_pInstance) return agent;
  Ranked_Lock instance(*m_InstanceMutex);
  return instanceLocked();
}

void ProviderAgent::addRefLocked() {
  TVX_LOG(TVX_DBG, "ProviderAgent::addRef[%d]", static_cast<int>(m_RefCount));
  m_RefCount++;
}

void ProviderAgent::addRef() {
  Ranked_Lock instance(*m_InstanceMutex);
  addRefLocked();
}

void ProviderAgent::releaseRef() {
  Ranked_Lock instance(*m_InstanceMutex);
  TVX_LOG(TVX_DBG, "ProviderAgent::releaseRef[%d]", static_cast<int>(m_RefCount));
  if (m_RefCount == 0) return;
  if (--m_RefCount == 0) {
    delete m_pInstance.load();
    m_pInstance = nullptr;
  }
}

std::int32_t ProviderAgent::acquire() {
  Ranked_Lock instance(*m_InstanceMutex);
  if (!instanceLocked()->isLoaded()) return LOAD_FAILED;
  addRefLocked();
  return LOAD_OK;
}

std::uint32_t ProviderAgent::refCount() {
  Ranked_Lock instance(*m_InstanceMutex);
  return m_RefCount;
}

// --- Construction --------------------------------------------------------------------------------

ProviderAgent::ProviderAgent() {
  registerBackEnds();
  m_ConfigFile.load(tvxPath(TVX_SETTINGS_PATH).c_str());
  [[maybe_unused]] const struct sigaction unusedAction = signalTraceAction();
  configureLogger();
  takeSettings();
  readHostInformation();
  try {
    openLibraries();
  } catch (...) {
    TVX_LOG(TVX_ERR, "Torvex CIM Provider load failure");
    m_bLoaded = false;
  }
}

void ProviderAgent::registerBackEnds() {
  CLogger& logger = getLogger();
  logger.registerInterface(&m_FileLogger);
  logger.registerInterface(&m_CIMLogger);
  logger.registerInterface(&m_SysLogger);
}

void ProviderAgent::configureLogger() {
  CLogger& logger = getLogger();
  logger.loadConfig();
  if (logger.isDumpAccessible())
    TVX_LOG(TVX_CRIT, " Continuing logs in Torvex log provider. ");
  else
    useDefaultLog();
}

void ProviderAgent::useDefaultLog() {
  CLogger& logger = getLogger();
  TVX_LOG(TVX_CRIT, " Please see the default log: %s", TVX_FFDC_LOG_PATH);
  logger.setDefaultLog();
  logger.enable();
  logger.setMode(TVX_LOG_MODE_FILE);
  if (m_FileLogger.validateAndSetPath(tvxFfdcLogPath().c_str(), true) != 0)
    TVX_LOG(TVX_ERR, "validateAndSetPath() failed");
}

void ProviderAgent::takeSettings() {
  m_CacheTimeout = m_ConfigFile.getCacheTimeout();
  m_bAdapterRefreshSetting = m_ConfigFile.getAdapterRefresh();
  m_bSANRefreshSetting = m_ConfigFile.getSANRefresh();
}

void ProviderAgent::readHostInformation() {
  if (getOSInformation(m_OSName, m_OSExtendedInfo) != 0)
    TVX_LOG(TVX_ERR, "getOSInformation() failed");
}

void ProviderAgent::openLibraries() {
  TVX_LOG(TVX_DBG, "Initializing RM API ");
  if (LoadRuntimeLibraries() == 1) TVX_LOG(TVX_ERR, "Error : In Loading Library ");
  m_pMethodWrapper = std::make_unique<TVX_MethodWrapper>();
  m_pData = std::make_unique<Data>();
  TVX_LOG(TVX_INFO, "Torvex Provider v%d.%d.%d-%d Loaded[%d]", PROVIDER_MAJOR, PROVIDER_MINOR,
          PROVIDER_REVISION, PROVIDER_BUILD, static_cast<int>(getpid()));
  m_bLoaded = true;
}

// --- Destruction ---------------------------------------------------------------------------------

ProviderAgent::~ProviderAgent() {
  try {
    tearDown();
  } catch (...) {
    TVX_LOG(TVX_ERR, "Error in ProviderAgent unload. Just continue");
  }
  // The back ends are members: the logger must not know them any longer, come what may.
  getLogger().dropInterfaces();
}

void ProviderAgent::tearDown() {
  TVX_LOG(TVX_DBG, "Entering dtor ~ProviderAgent()");
  stopRefreshThread();
  deleteDeviceModel();
  CPQFC_FreeLibrary();
  ClearMaps();
  if (!getLogger().isDefaultLog()) getLogger().writeDump();
  TVX_LOG(TVX_INFO, "Torvex Provider Unloaded");
  UnloadRuntimeLibraries();
}

void ProviderAgent::stopRefreshThread() {
  {
    Ranked_Lock thread(m_ThreadMutex);
    m_bLoaded = false;
  }
  if (m_pData) m_pData->stopScan();
  // No reader is left that could start another one. The thread takes m_ThreadMutex at its end, so
  // it is joined without it.
  joinRefreshThread();
}

void ProviderAgent::deleteDeviceModel() {
  TVX_LOG(TVX_DBG, "Deleting Data pointer");
  Ranked_Lock dataReady(m_AdapterDataReadyMutex);
  if (m_bIsAdapterDataBuilding) {
    TVX_LOG(TVX_DBG, "PERF: Waiting for m_bIsAdapterDataReady");
    m_AdapterDataReadyCond.wait_until(m_AdapterDataReadyMutex,
                                      [this] { return !m_bIsAdapterDataBuilding; });
    TVX_LOG(TVX_DBG, "PERF: Woken up from wait for m_bIsAdapterDataReady");
  }
  Ranked_Lock mapsReady(m_AdapterMapsReadyMutex);
  m_AdapterMapsReadyCond.wait_until(m_AdapterMapsReadyMutex,
                                    [this] { return !m_bIsAdapterMapsBuilding; });
  Ranked_Lock data(m_DataMutex);
  m_pData.reset();
  TVX_LOG(TVX_DBG, "MethodWrapper");
  m_pMethodWrapper.reset();
}

void ProviderAgent::ClearMaps() {
  TVX_LOG(TVX_DBG, "Entered ClearMaps()");
  {
    Ranked_Lock mapsReady(m_AdapterMapsReadyMutex);
    clearAdapterMaps();
  }
  {
    Ranked_Lock sanReady(m_SANMapsReadyMutex);
    clearSANMaps();
  }
  TVX_LOG(TVX_DBG, "Exiting ClearMaps()");
}

}  // namespace cimrt
