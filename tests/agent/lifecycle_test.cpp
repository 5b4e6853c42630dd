// The agent's life: its count, what construction reads and opens, what destruction leaves.
#include <dlfcn.h>
#include <sys/stat.h>
#include <syslog.h>
#include <unistd.h>

#include <fstream>
#include <sstream>
#include <stdexcept>
#include <thread>

#include "Agent_Fixture.h"
#include "No_Threads.h"
#include "access/TVX_Runtime_Loader.h"
#include "agent/Signal_Trace.h"
#include "common/TVX_Memory.h"
#include "model/TVX_Data.h"

namespace cimrt::test {
namespace {

using Lifecycle = Agent_Test;

std::string readFile(const std::filesystem::path& path) {
  std::ostringstream text;
  text << std::ifstream(path).rdbuf();
  return text.str();
}

TEST_F(Lifecycle, TwoLoadsAtOnceMakeOneAgent) {
  std::int32_t results[2] = {-1, -1};
  std::thread other([&] { results[1] = ProviderAgent::acquire(); });
  results[0] = ProviderAgent::acquire();
  other.join();
  EXPECT_EQ(results[0], LOAD_OK);
  EXPECT_EQ(results[1], LOAD_OK);
  EXPECT_EQ(ProviderAgent::refCount(), 2u);
  EXPECT_EQ(log.count("Initializing RM API "), 1u);
  EXPECT_EQ(log.count("ProviderAgent::addRef[0]"), 1u);
  EXPECT_EQ(log.count("ProviderAgent::addRef[1]"), 1u);
  ProviderAgent::releaseRef();
  EXPECT_EQ(ProviderAgent::refCount(), 1u);
  EXPECT_EQ(log.count("Entering dtor ~ProviderAgent()"), 0u);
  ProviderAgent::releaseRef();
  EXPECT_EQ(ProviderAgent::refCount(), 0u);
  EXPECT_EQ(log.count("Entering dtor ~ProviderAgent()"), 1u);
  EXPECT_EQ(log.level("ProviderAgent::releaseRef[2]"), TVX_DBG);
  EXPECT_EQ(log.level("ProviderAgent::releaseRef[1]"), TVX_DBG);
}

TEST_F(Lifecycle, TheNextAgentAfterTheLastReleaseIsNew) {
  ProviderAgent& first = startAgent();
  refresh(first);
  EXPECT_NE(first.m_LoadedTime.usec(), 0u);
  stopAgent();
  ProviderAgent& second = startAgent();
  EXPECT_TRUE(second.isLoaded());
  EXPECT_TRUE(second.m_bAdapterRefreshPending);
  EXPECT_FALSE(second.m_bSANRefreshPending);
  EXPECT_EQ(second.m_LoadedTime.usec(), 0u);
  EXPECT_TRUE(second.m_LoadedTime.is_interval());
  EXPECT_EQ(second.m_TVXHBA_FCPort_map.size(), 0u);
}

/// A machine that has the adapter library under its older name only.
void* openByOlderName(const char* file, int mode) {
  const std::string name = file;
  if (name == "liblrmapi.so") return ::dlopen("/nonexistent/liblrmapi.so", mode);
  return ::dlopen(name == "librmapi.so" ? "liblrmapi.so" : file, mode);
}

TEST_F(Lifecycle, TheOlderLibraryIsAnErrorThatStopsNothing) {
  static constexpr TVX_Dl_Operations OPERATIONS = {openByOlderName, ::dlsym, ::dlclose,
                                                   []() -> const char* { return ::dlerror(); }};
  setDlOperations(&OPERATIONS);
  ProviderAgent& agent = startAgent();
  EXPECT_EQ(log.count("Error : In Loading Library "), 1u);
  EXPECT_EQ(log.level("Error : In Loading Library "), TVX_ERR);
  EXPECT_TRUE(agent.isLoaded());
  refresh(agent);
  EXPECT_EQ(agent.m_TVXHBA_FCPort_map.size(), 4u);
  stopAgent();
  setDlOperations(nullptr);
  startAgent();
  EXPECT_EQ(log.count("Error : In Loading Library "), 1u) << "the usual library is no error";
}

TEST_F(Lifecycle, ReleaseWithoutReferenceLeavesTheCountAtZero) {
  ProviderAgent::releaseRef();
  EXPECT_EQ(ProviderAgent::refCount(), 0u);
  ProviderAgent& agent = startAgent();
  EXPECT_EQ(ProviderAgent::refCount(), 1u);
  EXPECT_TRUE(agent.isLoaded());
}

TEST_F(Lifecycle, AllFlagsAreDownAfterConstruction) {
  ProviderAgent& agent = startAgent();
  EXPECT_FALSE(agent.m_bIsAdapterDataReady);
  EXPECT_FALSE(agent.m_bIsAdapterDataBuilding);
  EXPECT_FALSE(agent.m_bIsAdapterMapsReady);
  EXPECT_FALSE(agent.m_bIsAdapterMapsBuilding);
  EXPECT_FALSE(agent.m_bIsSANMapsReady);
  EXPECT_FALSE(agent.m_bIsSANMapsBuilding);
  EXPECT_FALSE(agent.m_bThreadRunning);
  EXPECT_FALSE(agent.m_bOwnComputerSystem);
  EXPECT_EQ(agent.m_CIMLogger.capacity(), 1024);
}

TEST_F(Lifecycle, LoadIsReportedWithVersionAndProcess) {
  startAgent();
  EXPECT_EQ(log.level("Initializing RM API "), TVX_DBG);
  EXPECT_EQ(log.level("Torvex Provider v10.2.107-7 Loaded[" + std::to_string(getpid()) + "]"),
            TVX_INFO);
}

TEST_F(Lifecycle, RefusedInitialisationLeavesALivingAgentThatRefusesLoads) {
  addFault(R"({"call": "LRM_InitLib", "status": 1})");
  EXPECT_EQ(ProviderAgent::acquire(), LOAD_FAILED);
  EXPECT_EQ(ProviderAgent::refCount(), 0u);
  ProviderAgent* agent = ProviderAgent::getInstance();
  EXPECT_FALSE(agent->isLoaded());
  EXPECT_EQ(agent->m_pData, nullptr);
  EXPECT_EQ(agent->m_pMethodWrapper, nullptr);
  EXPECT_EQ(log.level("Torvex CIM Provider load failure"), TVX_ERR);
  // The unload of the refused provider.
  ProviderAgent::releaseRef();
  EXPECT_EQ(ProviderAgent::refCount(), 0u);
  EXPECT_EQ(ProviderAgent::getInstance(), agent);
  EXPECT_EQ(ProviderAgent::acquire(), LOAD_FAILED);
  // Counted once, so that this process can go on with a new one.
  ProviderAgent::addRef();
  ProviderAgent::releaseRef();
}

TEST_F(Lifecycle, FailedLoadAnswersEveryReaderEmpty) {
  addFault(R"({"call": "LRM_InitLib", "status": 1})");
  ProviderAgent& agent = startAgent();
  Delivered delivered;
  agent.enumInstances(agent.m_TVXHBA_FCPort_map, delivered.handler());
  agent.enumSANInstances(agent.m_TVXHBA_StorageVolume_map, delivered.handler());
  EXPECT_EQ(delivered.size(), 0u);
  EXPECT_TRUE(agent.m_bIsAdapterDataReady);
  EXPECT_TRUE(agent.m_bIsAdapterMapsReady);
  EXPECT_TRUE(agent.m_bIsSANMapsReady);
  EXPECT_EQ(agent.m_CIM_ComputerSystem_map.size(), 0u);
  EXPECT_EQ(log.level("Torvex Provider dependent library load has failed..do nothing is the only "
                      "option"),
            TVX_DBG);
  EXPECT_EQ(log.count("PERF: Updating Adapter Maps..."), 0u);
}

TEST_F(Lifecycle, FirstLoadWithoutLogSettingsFallsBackToTheDefaultLog) {
  startAgent();
  EXPECT_EQ(log.level(" Please see the default log: "
                      "/opt/ibm/platform/log/torvex_fc_provider_ffdc.log"),
            TVX_CRIT);
  EXPECT_TRUE(getLogger().isDefaultLog());
  EXPECT_TRUE(getLogger().isEnabled());
  EXPECT_EQ(getLogger().mode(), TVX_LOG_MODE_FILE);
  // Errors reach the file, news does not.
  const std::string text = readFile(root / "opt/ibm/platform/log/torvex_fc_provider_ffdc.log");
  EXPECT_EQ(text.find("Initializing RM API"), std::string::npos);
  TVX_LOG(TVX_ERR, "an error of this test");
  EXPECT_NE(readFile(root / "opt/ibm/platform/log/torvex_fc_provider_ffdc.log")
                .find("an error of this test"),
            std::string::npos);
  stopAgent();
  EXPECT_FALSE(std::filesystem::exists(root / "etc/torvex_fc_provider.dmp"));
}

TEST_F(Lifecycle, UnusableDefaultLogIsReportedAndBorne) {
  std::filesystem::remove_all(root / "opt/ibm/platform/log");
  std::filesystem::create_directories(root / "opt/ibm/platform/log/torvex_fc_provider_ffdc.log");
  ProviderAgent& agent = startAgent();
  EXPECT_EQ(log.level("validateAndSetPath() failed"), TVX_ERR);
  EXPECT_TRUE(agent.isLoaded());
}

TEST_F(Lifecycle, ReadableLogSettingsAreContinuedAndWrittenBack) {
  writeFile("etc/torvex_fc_provider.dmp", "1,4,1\n");
  startAgent();
  EXPECT_EQ(log.level(" Continuing logs in Torvex log provider. "), TVX_CRIT);
  EXPECT_FALSE(getLogger().isDefaultLog());
  EXPECT_EQ(getLogger().mode(), TVX_LOG_MODE_MEMORY);
  EXPECT_EQ(getLogger().level(), 4);
  std::filesystem::remove(root / "etc/torvex_fc_provider.dmp");
  stopAgent();
  EXPECT_EQ(readFile(root / "etc/torvex_fc_provider.dmp"), "1,4,1\n");
}

TEST_F(Lifecycle, SettingsAreTakenFromTheirFileAndWrittenBack) {
  writeFile("etc/torvex_fc_provider.conf",
            "TVX_PROVIDER_CACHE_TIMEOUT = 7\nTVX_PROVIDER_REFRESH_ADAPTERDATA = TRUE\n"
            "TVX_PROVIDER_REFRESH_SANDATA = FALSE\n");
  ProviderAgent& agent = startAgent();
  EXPECT_EQ(agent.m_CacheTimeout, 7u);
  EXPECT_TRUE(agent.m_bAdapterRefreshSetting);
  EXPECT_FALSE(agent.m_bSANRefreshSetting);
  stopAgent();
  const std::string text = readFile(root / "etc/torvex_fc_provider.conf");
  EXPECT_NE(text.find("TVX_PROVIDER_CACHE_TIMEOUT = 7"), std::string::npos);
}

TEST_F(Lifecycle, DefaultsStandWithoutSettingsFile) {
  ProviderAgent& agent = startAgent();
  EXPECT_EQ(agent.m_CacheTimeout, 10u);
  EXPECT_FALSE(agent.m_bAdapterRefreshSetting);
  EXPECT_TRUE(agent.m_bSANRefreshSetting);
}

TEST_F(Lifecycle, DestructionGoesThroughItsStepsInOrder) {
  startAgent();
  const std::vector<std::string> steps = {
      "Entering dtor ~ProviderAgent()",
      "Deleting Data pointer",
      "freeAllData: Entry",
      "MethodWrapper",
      "TVX_MethodWrapper::Destructor",
      "Entered ClearMaps()",
      "PERF: Entered clearAdapterMaps()",
      "Clearing Record Log maps",
      "Clearing SoftwareUpdate maps",
      "Clearing Software Update maps",
      "Exiting clearAdapterMaps()",
      "PERF: Entered clearSANMaps()",
      "Exiting clearSANMaps()",
      "Exiting ClearMaps()",
      "Torvex Provider Unloaded",
  };
  log.clear();
  stopAgent();
  EXPECT_EQ(log.only(steps), steps);
  EXPECT_EQ(log.level("Torvex Provider Unloaded"), TVX_INFO);
  EXPECT_EQ(log.count("PERF: Clearing the previous thread...with join"), 0u);
}

TEST_F(Lifecycle, UnloadInTheMiddleOfARunJoinsTheThreadFirst) {
  ProviderAgent& agent = startAgent();
  addFault(R"({"call": "LRM_GetHBAAttributes", "delay_ms": 40})");
  agent.BuildCimrtInfo();
  stopAgent();
  const std::vector<std::string> steps = {
      "Entering dtor ~ProviderAgent()", "PERF: Clearing the previous thread...with join",
      "PERF: DataFetch_Handler Thread END", "Deleting Data pointer"};
  EXPECT_EQ(log.only(steps), steps);
}

TEST_F(Lifecycle, UnloadJoinsAThreadThatHasEnded) {
  ProviderAgent& agent = startAgent();
  refresh(agent);
  log.clear();
  stopAgent();
  EXPECT_EQ(log.count("PERF: Clearing the previous thread...with join"), 1u);
}

TEST_F(Lifecycle, LibrariesAreClosedWithTheLastReference) {
  startAgent();
  EXPECT_NE(runtimeLibraryHandle(TVX_SLOT_LRMAPI), nullptr);
  EXPECT_NE(runtimeLibraryHandle(TVX_SLOT_HBAAPI), nullptr);
  stopAgent();
  EXPECT_EQ(runtimeLibraryHandle(TVX_SLOT_LRMAPI), nullptr);
  EXPECT_EQ(runtimeLibraryHandle(TVX_SLOT_HBAAPI), nullptr);
}

/// Back end that throws at one text.
class Throwing_Log : public TVX_LoggerInterface {
 public:
  explicit Throwing_Log(const char* text) : m_Text(text) { getLogger().registerInterface(this); }
  ~Throwing_Log() override { getLogger().unregisterInterface(this); }
  void log(int, const char*, const unsigned*, const char* text) override {
    if (m_Text == text) throw std::runtime_error(text);
  }
  void open() override {}
  void close() override {}
  void clear() override {}

 private:
  const std::string m_Text;
};

TEST_F(Lifecycle, AFailureWhileUnloadingIsReportedAndTheNextAgentIsWhole) {
  {
    const Throwing_Log failing("MethodWrapper");
    refresh(startAgent());
    stopAgent();
    EXPECT_EQ(log.level("Error in ProviderAgent unload. Just continue"), TVX_ERR);
    EXPECT_EQ(log.count("Torvex Provider Unloaded"), 0u);
  }
  getLogger().registerInterface(&log);
  ProviderAgent& next = startAgent();
  refresh(next);
  EXPECT_EQ(next.m_TVXHBA_FCPort_map.size(), 4u);
}

TEST_F(Lifecycle, AFailureWhileTheSANMapsAreClearedIsReported) {
  ProviderAgent& agent = startAgent();
  const Throwing_Log failing("Exiting clearSANMaps()");
  refresh(agent);
  EXPECT_EQ(log.level("Error in clearSANMaps()"), TVX_DBG);
  EXPECT_TRUE(agent.m_bIsSANMapsReady);
}

TEST_F(Lifecycle, WithoutMemoryTheHostIsUnknownAndTheAgentStands) {
  writeFile("etc/issue", "Some system");
  tvxSetAllocator([](std::size_t) -> void* { return nullptr; });
  ProviderAgent& agent = startAgent();
  tvxSetAllocator(nullptr);
  EXPECT_EQ(log.level("getOSInformation() failed"), TVX_ERR);
  EXPECT_EQ(agent.m_OSExtendedInfo, "Unknown");
  EXPECT_TRUE(agent.isLoaded());
}

TEST_F(Lifecycle, UnloadWaitsForAnAdapterBuildThatIsUnderWay) {
  ProviderAgent& agent = startAgent();
  agent.m_bIsAdapterDataBuilding = true;
  std::thread builder([&] {
    while (log.count("PERF: Waiting for m_bIsAdapterDataReady") == 0) std::this_thread::yield();
    Ranked_Lock dataReady(agent.m_AdapterDataReadyMutex);
    EXPECT_NE(agent.m_pData, nullptr);
    agent.m_bIsAdapterDataBuilding = false;
    agent.m_AdapterDataReadyCond.broadcast();
  });
  stopAgent();
  builder.join();
  EXPECT_EQ(log.level("PERF: Waiting for m_bIsAdapterDataReady"), TVX_DBG);
  EXPECT_EQ(log.level("PERF: Woken up from wait for m_bIsAdapterDataReady"), TVX_DBG);
}

TEST_F(Lifecycle, WithoutAThreadTheReaderBuildsTheMapsItself) {
  ProviderAgent& agent = startAgent();
  Delivered ports;
  {
    const No_Threads none;
    agent.enumInstances(agent.m_TVXHBA_FCPort_map, ports.handler());
  }
  EXPECT_EQ(log.level("DataFetch_Handler thread could not be created"), TVX_CRIT);
  EXPECT_EQ(ports.size(), 4u);
  EXPECT_FALSE(agent.m_bThreadRunning);
}

TEST(SignalTraceDeathTest, TellsTheSystemLogAndEndsTheProcess) {
  testing::FLAGS_gtest_death_test_style = "threadsafe";
  const auto handle = [] {
    openlog("trace", LOG_PERROR, LOG_USER);
    signalTraceAction().sa_sigaction(SIGUSR1, nullptr, nullptr);
  };
  EXPECT_EXIT(handle(), testing::ExitedWithCode(1), "Signal in CIM Provider");
  EXPECT_EXIT(handle(), testing::ExitedWithCode(1), "Back Trace Execution Path:");
  EXPECT_EXIT(handle(), testing::ExitedWithCode(1), "Trace message \\[bt\\] ");
}

TEST(SignalTrace, IsDescribedAndNotInstalled) {
  const struct sigaction action = signalTraceAction();
  EXPECT_EQ(action.sa_flags, SA_SIGINFO);
  ASSERT_NE(action.sa_sigaction, nullptr);
  for (const int signal : {SIGSEGV, SIGABRT, SIGBUS}) {
    struct sigaction installed {};
    ASSERT_EQ(sigaction(signal, nullptr, &installed), 0);
    EXPECT_NE(installed.sa_sigaction, action.sa_sigaction) << signal;
  }
}

}  // namespace
}  // namespace cimrt::test
