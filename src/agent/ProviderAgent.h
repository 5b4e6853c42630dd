// The one object behind all class providers: device model, instance maps and their refresh thread.
//
// Lock order, outermost first; Ranked_Mutex asserts it in debug builds:
//
//   1. m_InstanceMutex          singleton pointer and reference count; `releaseRef` alone holds it
//                               over the destructor, everybody else takes it alone
//   2. m_ThreadMutex            start and end of the refresh thread; taken alone, except for 1
//   3. m_AdapterDataReadyMutex  held by the thread while the device tree is built
//   4. m_AdapterMapsReadyMutex  held by the thread while the adapter maps are built
//   5. m_SANMapsReadyMutex      held by the thread while the SAN maps are built
//   6. m_DataMutex              the device tree and the contents of the maps
//   7. an active class's static mutex, or the mutex inside m_ConfigFile
//   8. the logger's mutex
//
// The thread holds 3, 4 and 5 together through the SAN stage, so readers of adapter classes wait
// for it to end. A wait on a condition gives back the condition's own mutex alone: an active reader
// keeps 3 while it waits for the maps. That cannot lock up, since a run of the thread is through
// with 3 before it builds the maps, and no second run starts before it has ended.
//
// Nothing is delivered to the server while one of these locks is held.
#pragma once

#include <atomic>
#include <cstdint>
#include <memory>
#include <string>

#include "agent/Device_Log_Buffer.h"
#include "agent/Ranked_Mutex.h"
#include "common/CLogger.h"
#include "common/TvxConfigFile.h"
#include "generated/Agent_Maps.h"
#include "runtime/Datetime.h"
#include "runtime/Instance_Map.h"
#include "runtime/Lasting.h"
#include "runtime/Provider_Operations.h"
#include "runtime/Threads.h"

namespace cimrt {

class Data;
class TVX_MethodWrapper;
class ProviderAgent;

/// Version of the provider.
inline constexpr int PROVIDER_MAJOR = 10;
inline constexpr int PROVIDER_MINOR = 2;
inline constexpr int PROVIDER_REVISION = 107;
inline constexpr int PROVIDER_BUILD = 7;

/// The system log, without the TVX_ROOT prefix.
inline constexpr const char* SYSTEM_LOG_PATH = "/var/log/messages";

/// Result of a failed map builder; 0 is success.
inline constexpr std::int32_t MAP_BUILD_FAILED = 0x8001;

/// Brings the entries of one active class up to date; called with all the reader's locks held.
using Live_Update = void (*)(ProviderAgent& agent);

/// Singleton by reference count: the first `load` of a class provider in the process creates it,
/// the last `unload` destroys it. A failed opening of the management libraries leaves a living
/// agent that is not loaded: its maps stay empty and every reader is answered at once.
class ProviderAgent : public Agent_Maps {
 public:
  /// The agent, created at need. Never null; no exception leaves it. The pointer is good for as
  /// long as the caller (or its provider) holds a reference. Any thread, with no agent lock held.
  static ProviderAgent* getInstance();
  /// Counts one more class provider.
  static void addRef();
  /// Counts one class provider less and destroys the agent with the last one: joins the refresh
  /// thread and closes the libraries. Without a matching `addRef` the count stays at 0.
  static void releaseRef();
  /// `getInstance` and, if the libraries are open, `addRef`, as one step that no concurrent
  /// `releaseRef` can come between. What a class provider's `load` does.
  /// @return LOAD_OK with a reference taken, or LOAD_FAILED without one
  static std::int32_t acquire();
  /// The present count, for tests.
  static std::uint32_t refCount();

  /// True while the management libraries are open and initialised. Any thread.
  bool isLoaded() const { return m_bLoaded; }

  /// Starts the refresh thread if the cache is too old or a refresh is pending, and returns at once
  /// without waiting for it. Called at the start of every read, with no agent lock held. Always 0.
  std::int32_t BuildCimrtInfo();
  /// True if the cache is older than `m_CacheTimeout`. The caller holds `m_ThreadMutex`.
  bool isTimeOut() const;

  /// Delivers a clone of every entry of `map`, once the adapter maps are ready. Nothing is
  /// delivered when the copy fails; no exception leaves it. No agent lock may be held.
  template <class T>
  void enumInstances(Instance_Map<T>& map, const Instance_Handler& handler) {
    enumPlain(map, handler);
  }
  /// The same for a class whose values change between refreshes: `update` runs first, with the
  /// locks held, and never in two threads at once for one class.
  template <class T>
  void enumActiveInstances(Instance_Map<T>& map, const Instance_Handler& handler,
                           Live_Update update) {
    static Lasting<Ranked_Mutex> classMutex(Lock_Rank::CLASS_STATIC, true);
    enumActive(map, handler, update, *classMutex);
  }
  /// The same for a class that is built from the SAN, which is scanned now if it was not since the
  /// last adapter refresh.
  template <class T>
  void enumSANInstances(Instance_Map<T>& map, const Instance_Handler& handler) {
    enumSAN(map, handler);
  }

  /// What an operation that changes the model does before it takes `m_DataMutex`: asks for a
  /// refresh if one is due, then waits for the device tree and for the adapter maps. No agent lock
  /// may be held; none is held afterwards.
  void awaitAdapterMaps();

  /// Refills the adapter maps from the device tree; the refresh thread calls it with
  /// `m_AdapterMapsReadyMutex` and `m_DataMutex` held. 0, or MAP_BUILD_FAILED with the maps as far
  /// as they got.
  std::int32_t updateAdapterMaps();
  /// Refills the SAN maps from the targets of the device tree; the refresh thread calls it with
  /// `m_SANMapsReadyMutex` and `m_DataMutex` held. 0, or MAP_BUILD_FAILED.
  std::int32_t updateSANMaps();
  /// Empties the adapter maps, in a fixed order. The caller holds `m_AdapterMapsReadyMutex`, and
  /// `m_DataMutex` unless it is the destructor.
  void clearAdapterMaps();
  /// Empties the SAN maps. The caller holds `m_SANMapsReadyMutex`.
  void clearSANMaps();

  /// Adds what the driver wrote to the system log to `m_DeviceLogBuffer`, newest line first, as far
  /// as there is room. A system log that can't be read has no lines. The caller holds `m_DataMutex`
  /// and has emptied the buffer.
  void readDriverLog();

  /// First of all members, and so the last to go: the logger and the like outlive the agent.
  const At_Work m_AtWork;

  // --- Refresh control. Read and written from any thread; the settings come from m_ConfigFile.
  std::atomic<bool> m_bAdapterRefreshPending{true};   ///< an adapter rebuild is owed
  std::atomic<bool> m_bAdapterRefreshSetting{false};  ///< rebuild the adapters on every run
  std::atomic<bool> m_bSANRefreshPending{false};      ///< a SAN reader asked for a scan
  std::atomic<bool> m_bSANRefreshSetting{false};      ///< scan the SAN after every adapter build
  std::atomic<std::uint32_t> m_CacheTimeout{0};       ///< age limit of the cache in minutes

  // --- Log back ends and settings: constant after construction, locked inside.
  TVX_FileLogger m_FileLogger;
  TVX_CIMLogger m_CIMLogger;
  TVX_SysLogger m_SysLogger;
  TvxConfigFile m_ConfigFile;

  // --- The device model. Guarded by m_DataMutex, which also guards the contents of the maps.
  Ranked_Mutex m_DataMutex{Lock_Rank::DATA};
  std::unique_ptr<Data> m_pData;                        ///< null until loaded
  std::unique_ptr<TVX_MethodWrapper> m_pMethodWrapper;  ///< null until loaded

  // --- Lines of the driver log, newest first. Guarded by m_DataMutex; no refresh empties it.
  Device_Log_Buffer m_DeviceLogBuffer;

  // --- Readiness. Written by the refresh thread alone, tested under the mutex of the group.
  Ranked_Mutex m_AdapterDataReadyMutex{Lock_Rank::ADAPTER_DATA};
  Ranked_Cond m_AdapterDataReadyCond;
  std::atomic<bool> m_bIsAdapterDataReady{false};
  std::atomic<bool> m_bIsAdapterDataBuilding{false};
  Ranked_Mutex m_AdapterMapsReadyMutex{Lock_Rank::ADAPTER_MAPS};
  Ranked_Cond m_AdapterMapsReadyCond;
  std::atomic<bool> m_bIsAdapterMapsReady{false};
  std::atomic<bool> m_bIsAdapterMapsBuilding{false};
  Ranked_Mutex m_SANMapsReadyMutex{Lock_Rank::SAN_MAPS};
  Ranked_Cond m_SANMapsReadyCond;
  std::atomic<bool> m_bIsSANMapsReady{false};
  std::atomic<bool> m_bIsSANMapsBuilding{false};

  // --- The host, as text. Guarded by m_DataMutex after construction.
  std::string m_OSName;
  std::string m_OSExtendedInfo;
  std::string m_HostName;
  std::string m_IPAddress;
  bool m_bOwnComputerSystem = false;  ///< the computer system was made here; never cleared again

  // --- The refresh thread. Guarded by m_ThreadMutex.
  mutable Ranked_Mutex m_ThreadMutex{Lock_Rank::THREAD};
  Datetime m_LoadedTime;          ///< when the cache was last completed; the zero interval before
  bool m_bThreadRunning = false;  ///< started and not ended

  ProviderAgent(const ProviderAgent&) = delete;
  ProviderAgent& operator=(const ProviderAgent&) = delete;

 private:
  friend struct Unreferenced_Agent;

  ProviderAgent();
  ~ProviderAgent();

  // Construction and destruction, step by step (ProviderAgent.cpp).
  void registerBackEnds();
  void configureLogger();
  void useDefaultLog();
  void takeSettings();
  void readHostInformation();
  void openLibraries();
  void tearDown();
  void stopRefreshThread();
  void deleteDeviceModel();
  void ClearMaps();

  static ProviderAgent* instanceLocked();
  static void addRefLocked();

  // The refresh thread (Refresh.cpp).
  static void* DataFetch_Handler(void* agent);
  bool startRefreshThread();
  void joinRefreshThread();
  void runStages();
  void buildAdapterTree();
  void rebuildAdapterMaps();
  void runSANStage();
  void rebuildSANTargets();
  void rebuildSANMaps();
  bool finishRun();
  void announceEndOfRun();

  // Enumeration behind the templates (Enumeration.cpp).
  void enumPlain(Instance_Map_Base& map, const Instance_Handler& handler);
  void enumActive(Instance_Map_Base& map, const Instance_Handler& handler, Live_Update update,
                  Ranked_Mutex& classMutex);
  void enumSAN(Instance_Map_Base& map, const Instance_Handler& handler);
  std::uint64_t askForSANMaps();

  std::atomic<bool> m_bLoaded{false};
  Thread m_Thread;                 ///< handle of the last refresh thread; guarded by m_ThreadMutex
  bool m_bThreadJoinable = false;  ///< that handle was not joined yet; guarded by m_ThreadMutex

  std::uint64_t m_EndedRuns = 0;  ///< runs of the thread so far; guarded by m_SANMapsReadyMutex

  static std::atomic<ProviderAgent*> m_pInstance;
  static std::uint32_t m_RefCount;  ///< guarded by m_InstanceMutex
  static Lasting<Ranked_Mutex> m_InstanceMutex;
};

}  // namespace cimrt
