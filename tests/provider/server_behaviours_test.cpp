// The library under servers of every kind: what they hand out, how they start and stop, and what
// their processes lack.
#include <fcntl.h>
#include <linux/capability.h>
#include <pthread.h>
#include <sys/syscall.h>

#include <atomic>
#include <chrono>
#include <fstream>
#include <functional>
#include <map>
#include <sstream>
#include <thread>

#include "Child_Process.h"
#include "Provider_Fixture.h"
#include "tvxsim/tvxsim.h"

namespace tvx::test {
namespace {

using host::BrokerOptions;
using host::KeyForm;
using host::ObjectPath;
using host::Reply;
using host::Value;

constexpr const char* PLATFORM = R"({"version": 1, "namespaces": ["root/ibmse"], "instances": [
    {"class": "IBMSD_ComputerSystem", "namespace": "root/ibmse",
     "keys": ["CreationClassName", "Name"],
     "properties": {"CreationClassName": "IBMSD_ComputerSystem", "Name": "vios1"}}]})";

class Server_Behaviours : public Provider_Test {
 protected:
  /// How many instances each class has.
  std::map<std::string, std::size_t> census() {
    std::map<std::string, std::size_t> counts;
    for (const std::string& name : servedClasses()) counts[name] = instances(name).size();
    return counts;
  }

  /// Takes the first instance of every class by its path, and walks from some of them.
  void expectEveryClassIsReached() {
    for (const std::string& name : servedClasses()) {
      const Reply names = broker->enumerateInstanceNames(name);
      EXPECT_EQ(names.status.rc, CMPI_RC_OK) << name;
      if (names.paths.empty()) continue;
      const Reply got = broker->getInstance(names.paths.front());
      EXPECT_EQ(got.status.rc, CMPI_RC_OK) << name;
      EXPECT_FALSE(got.report.leaks()) << name << got.report.text();
    }
    for (const char* name : {"TVXHBA_FCPort", "TVXHBA_StorageVolume", "TVXHBA_RegisteredProfile"}) {
      const Reply walked =
          broker->associatorNames(broker->enumerateInstanceNames(name).paths.at(0));
      EXPECT_EQ(walked.status.rc, CMPI_RC_OK) << name;
      EXPECT_FALSE(walked.paths.empty()) << name;
      EXPECT_FALSE(walked.report.leaks()) << name << walked.report.text();
    }
  }

  /// Every class, with every method called without arguments.
  void askForEverything() {
    expectEveryClassIsReached();
    for (const std::string& name : servedClasses()) {
      const ObjectPath path{"", "", name, {}};
      for (const host::MethodData& method : host::methods(*classes->find(name)))
        EXPECT_NE(broker->invokeMethod(path, method.name).status.rc, CMPI_RC_ERR_METHOD_NOT_FOUND);
    }
  }

  /// The server does nothing more: what it has goes with its process.
  void leaveBroker() {
    static host::Broker* volatile left = nullptr;  // for leak checkers to find
    left = broker.release();
    EXPECT_TRUE(left != nullptr);
  }

  std::string settings() const {
    std::ifstream file(root / "etc/torvex_fc_provider.conf");
    std::ostringstream text;
    text << file.rdbuf();
    return text.str();
  }
};

// ---- What a server hands out

TEST_F(Server_Behaviours, ServersOfEveryVersionSeeTheSame) {
  load();
  const auto expected = census();
  EXPECT_GT(expected.at("TVXHBA_FCPort"), 0U);
  unload();
  for (const int version : {0, 100, 200}) {
    BrokerOptions options;
    options.version = version;
    if (version == 0) options.user.reset();
    load(options);
    EXPECT_EQ(census(), expected) << version;
    askForEverything();
    unload();
  }
}

TEST_F(Server_Behaviours, KeysAreFoundInEveryFormThatServersGiveThem) {
  for (const KeyForm form :
       {KeyForm::Declared, KeyForm::Unsigned64, KeyForm::Signed64, KeyForm::Text}) {
    BrokerOptions options;
    options.keys = form;
    load(options);
    expectEveryClassIsReached();
    unload();
  }
}

TEST_F(Server_Behaviours, NoKeyIsANumberThatAServerCouldWiden) {
  // Every form of integer keys is the same to these classes; the bridge's own tests narrow them.
  for (std::size_t i = 0; i < host::allClassCount; ++i)
    for (const host::FeatureData& feature : host::features(host::allClasses[i])) {
      if (!feature.isKey) continue;
      EXPECT_TRUE(feature.cmpiType == CMPI_string || feature.cmpiType == CMPI_ref)
          << host::allClasses[i].name << "." << feature.name;
    }
}

TEST_F(Server_Behaviours, KeysThatTheClassDoesNotHaveAreLeftAside) {
  load();
  for (const std::string& name : servedClasses()) {
    const Reply names = broker->enumerateInstanceNames(name);
    if (names.paths.empty()) continue;
    ObjectPath path = names.paths.front();
    path.keys.set("NoSuchKey", Value::number(CMPI_uint64, 1));
    const Reply got = broker->getInstance(path);
    EXPECT_EQ(got.status.rc, CMPI_RC_OK) << name << ": " << got.status.message;
    EXPECT_FALSE(got.report.leaks()) << name << got.report.text();
  }
}

TEST_F(Server_Behaviours, NumbersWrittenAsTextsAreReadByTheParametersType) {
  load();
  const ObjectPath log = [&] {
    for (const ObjectPath& each : broker->enumerateInstanceNames("TVXHBA_RecordLog").paths)
      if (each.key("InstanceID").asText().starts_with("TVXHBA:ProviderLog:")) return each;
    return ObjectPath{};
  }();
  const std::string file = (root / "opt/ibm/platform/log/told.log").string();
  const auto set = [&](const Value& level, const Value& mode) {
    const Reply reply = broker->invokeMethod(
        log, "SetLogParams",
        {{"LogLevel", level}, {"LogMode", mode}, {"TracePath", Value::string(file)}});
    EXPECT_EQ(reply.status.rc, CMPI_RC_OK);
    EXPECT_FALSE(reply.report.leaks()) << reply.report.text();
    return reply.returnValue.asUnsigned();
  };
  EXPECT_EQ(set(Value::string("4"), Value::string("2")), 0U);
  const Reply shown = broker->getInstance(log);
  ASSERT_EQ(shown.instances.size(), 1U);
  EXPECT_EQ(shown.instances[0].property("LogLevel").asUnsigned(), 4U);
  EXPECT_EQ(shown.instances[0].property("LogMode").asUnsigned(), 2U);
  // A number of another width is no value for the parameter, which stays empty.
  EXPECT_EQ(set(Value::number(CMPI_uint64, 4), Value::number(CMPI_uint16, 2)), 0x80C8U);
}

TEST_F(Server_Behaviours, AMethodThatRanAnswersAValueOfAType) {
  // There are servers that end when they are handed a value without a type.
  load();
  std::size_t answered = 0;
  for (const std::string& name : servedClasses()) {
    const Reply names = broker->enumerateInstanceNames(name);
    if (names.paths.empty()) continue;
    for (const host::MethodData& method : host::methods(*classes->find(name))) {
      const Reply reply = broker->invokeMethod(names.paths.front(), method.name);
      if (reply.status.rc != CMPI_RC_OK) continue;
      EXPECT_NE(reply.returnValue.type(), CMPI_null) << name << "." << method.name;
      EXPECT_NE(method.returnType, CMPI_ref) << name << "." << method.name;
      ++answered;
    }
  }
  EXPECT_GT(answered, 10U);
}

TEST_F(Server_Behaviours, APathWithoutNamespaceIsServed) {
  load();
  const auto expected = census();
  unload();
  for (const int version : {0, 200}) {
    BrokerOptions options;
    options.version = version;
    options.tellsNameSpace = false;
    load(options);
    EXPECT_EQ(census(), expected);
    expectEveryClassIsReached();
    unload();
  }
}

TEST_F(Server_Behaviours, AnAttachThatDoesNothingIsEnough) {
  BrokerOptions options;
  options.version = 0;
  options.attaches = false;
  load(options);
  broker->addForeign(PLATFORM);
  // The platform's system is looked up on the library's own thread.
  const std::vector<host::Instance> ports = instances("TVXHBA_FCPort");
  ASSERT_EQ(ports.size(), 4U);
  EXPECT_EQ(ports[0].text("SystemName"), "vios1");
}

TEST_F(Server_Behaviours, NothingOfARequestIsTouchedAfterItsEnd) {
  load();
  broker->addForeign(PLATFORM);
  askForEverything();
  askForEverything();
  EXPECT_TRUE(broker->lateNotes().empty());
  // The broker aborts if the unloading looks at an object of a request that is over.
  unload();
}

// ---- How a server stops

TEST_F(Server_Behaviours, OneCleanupOfEachKindAndTheProcessEnds) {
  for (const bool terminating : {false, true}) {
    EXPECT_EQ(inChild([&] {
                addFault(R"({"call": "HBA_GetFcpTargetMapping", "delay_ms": 5})");
                load();
                census();
                EXPECT_EQ(broker->cleanupOncePerKind(terminating).rc, CMPI_RC_OK);
                leaveBroker();
              }),
              0)
        << terminating;
  }
}

TEST_F(Server_Behaviours, TheProcessMayEndWhileTheLibraryIsAtWork) {
  EXPECT_EQ(inChild([&] {
              // Registered first, run last: the refresh goes on behind the library's own end.
              std::atexit([] { std::this_thread::sleep_for(std::chrono::milliseconds(60)); });
              addFault(R"({"call": "HBA_GetFcpTargetMapping", "delay_ms": 10})");
              load();
              EXPECT_EQ(instances("TVXHBA_FCPort").size(), 4U);
              leaveBroker();
            }),
            0);
}

TEST_F(Server_Behaviours, CleanupOnAnotherThreadWhileRequestsRunAndTheProcessEnds) {
  EXPECT_EQ(inChild([&] {
              load();
              std::vector<std::thread> clients;
              std::atomic<int> wrong{0};
              for (const char* name : {"TVXHBA_FCPort", "TVXHBA_Card", "TVXHBA_StorageVolume"})
                clients.emplace_back([&, name] {
                  for (int i = 0; i < 20; ++i) {
                    const int code = broker->enumerateInstances(name).status.rc;
                    // A request that comes after the unloading of its class is refused.
                    if (code != CMPI_RC_OK && code != CMPI_RC_ERR_FAILED) ++wrong;
                  }
                });
              std::thread server([&] { broker->cleanupOncePerKind(true); });
              server.join();
              for (std::thread& client : clients) client.join();
              EXPECT_EQ(wrong, 0);
              leaveBroker();
            }),
            0);
}

/// What the library is doing while the server ends.
struct Moment {
  const char* call;  ///< of the management libraries
  const char* asks;  ///< the class that a client enumerates
};

TEST_F(Server_Behaviours, AServerMayTerminateAtAnyMoment) {
  const Moment moments[] = {{"LRM_InitLib", "TVXHBA_FCPort"},
                            {"LRM_GetServerAttributes", "TVXHBA_Card"},
                            {"HBA_GetNumberOfAdapters", "TVXHBA_Card"},
                            {"LRM_GetHBAAttributes", "TVXHBA_FCPort"},
                            {"HBA_OpenAdapter", "TVXHBA_StorageVolume"},
                            {"HBA_GetFcpTargetMapping", "TVXHBA_StorageVolume"},
                            {"HBA_SendScsiInquiry", "TVXHBA_StorageVolume"},
                            {"HBA_SendReadCapacity", "TVXHBA_StorageVolume"},
                            {"LRM_GetPortStatistics", "TVXHBA_FCPortStatistics"}};
  for (const Moment& moment : moments) {
    useScenario();
    addFault(std::string(R"({"call": ")") + moment.call + R"(", "first": 1, "delay_ms": 15})");
    load();
    std::atomic<int> code{-1};
    std::thread client([&] {
      const Reply reply = broker->enumerateInstances(moment.asks);
      EXPECT_FALSE(reply.report.leaks()) << moment.call << reply.report.text();
      code = reply.status.rc;
    });
    while (tvxsim_calls(moment.call, nullptr) == 0 && code == -1) std::this_thread::yield();
    EXPECT_GT(tvxsim_calls(moment.call, nullptr), 0U) << moment.call << " is not reached";
    EXPECT_EQ(broker->cleanup(moment.asks, host::InterfaceKind::Instance, true).rc, CMPI_RC_OK)
        << moment.call;
    client.join();
    // A request that comes after the unloading of its class is refused.
    EXPECT_TRUE(code == CMPI_RC_OK || code == CMPI_RC_ERR_FAILED) << moment.call << " " << code;
    unload();
    EXPECT_EQ(tvxsim_open_handles(), 0U) << moment.call;
  }
}

// ---- What a server's process is like

TEST_F(Server_Behaviours, TheLibraryIsLoadedByAForkedProcess) {
  const auto serve = [&] {
    load();
    EXPECT_EQ(instances("TVXHBA_FCPort").size(), 4U);
    unload();
  };
  EXPECT_EQ(inChild(serve), 0);
  // A process that had the library itself and gave it up may fork as well.
  serve();
  EXPECT_EQ(inChild(serve), 0);
  serve();
}

TEST_F(Server_Behaviours, TheStandardStreamsMayBeClosed) {
  EXPECT_EQ(inChild([&] {
              load();
              askForEverything();
              unload();
            }),
            0);
  const std::string usual = settings();
  EXPECT_FALSE(usual.empty());
  std::filesystem::remove(root / "etc/torvex_fc_provider.conf");
  EXPECT_EQ(inChild([&] {
              for (int stream = 0; stream < 3; ++stream) close(stream);
              load();
              askForEverything();
              unload();
            }),
            0);
  EXPECT_EQ(settings(), usual) << "something was printed into a file that took a stream's number";
}

TEST_F(Server_Behaviours, AFullDiskIsNoReasonToFail) {
  EXPECT_EQ(inChild([&] {
              // No file can grow: every write fails as it does on a disk without room.
              signal(SIGXFSZ, SIG_IGN);
              const rlimit nothing = {0, 0};
              setrlimit(RLIMIT_FSIZE, &nothing);
              load();
              askForEverything();
              unload();
            }),
            0);
  EXPECT_EQ(settings(), "");
}

/// Makes the permissions of files count for root as well.
void obeyPermissions() {
  __user_cap_header_struct head = {_LINUX_CAPABILITY_VERSION_3, 0};
  __user_cap_data_struct sets[2] = {};
  if (syscall(SYS_capget, &head, sets) != 0) return;
  sets[0].effective &= ~((1U << CAP_DAC_OVERRIDE) | (1U << CAP_FOWNER));
  syscall(SYS_capset, &head, sets);
}

TEST_F(Server_Behaviours, ARootThatCannotBeWrittenIsNoReasonToFail) {
  const auto each = [&](std::filesystem::perms mode) {
    std::filesystem::permissions(root, mode);
    for (const auto& entry : std::filesystem::recursive_directory_iterator(root))
      if (entry.is_directory()) std::filesystem::permissions(entry.path(), mode);
  };
  each(std::filesystem::perms::owner_read | std::filesystem::perms::owner_exec);
  EXPECT_EQ(inChild([&] {
              obeyPermissions();
              EXPECT_LT(open((root / "etc/probe").c_str(), O_CREAT | O_WRONLY, 0600), 0);
              load();
              askForEverything();
              unload();
            }),
            0);
  each(std::filesystem::perms::owner_all);
  EXPECT_TRUE(std::filesystem::is_empty(root / "etc"));
}

#if defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__)
constexpr std::size_t REQUEST_STACK =
    1024 * 1024;  // the sanitizers' frames are several times larger
#else
constexpr std::size_t REQUEST_STACK = 256 * 1024;
#endif

TEST_F(Server_Behaviours, ASmallStackIsEnoughForEveryRequest) {
  load();
  pthread_attr_t attributes;
  pthread_attr_init(&attributes);
  ASSERT_EQ(pthread_attr_setstacksize(&attributes, REQUEST_STACK), 0);
  std::function<void()> body = [this] { askForEverything(); };
  const auto work = [](void* function) -> void* {
    (*static_cast<std::function<void()>*>(function))();
    return nullptr;
  };
  pthread_t thread = {};
  ASSERT_EQ(pthread_create(&thread, &attributes, work, &body), 0);
  pthread_join(thread, nullptr);
  pthread_attr_destroy(&attributes);
}

}  // namespace
}  // namespace tvx::test
