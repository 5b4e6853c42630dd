// The library under servers of every kind: what they hand out, how they start and stop, and what
// their processes lack.
#include <dlfcn.h>
#include <fcntl.h>
#include <linux/capability.h>
#include <sys/syscall.h>

#include <atomic>
#include <chrono>
#include <fstream>
#include <map>
#include <sstream>
#include <thread>

#include "Child_Process.h"
#include "Provider_Fixture.h"
#include "tests/support/Request_Thread.h"
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
  /// What the instances of each class tell.
  using Census = std::map<std::string, std::vector<std::string>>;
  Census census() {
    instances("TVXHBA_StorageVolume");  // waits for the scan, which adds to what adapters tell
    Census texts;
    for (const std::string& name : servedClasses())
      for (const host::Instance& instance : instances(name))
        texts[name].push_back(contentsOf(instance));
    return texts;
  }
  /// Keys and properties as texts, but for times, which go on from one look to the next.
  static std::string contentsOf(const host::Instance& instance) {
    std::string text;
    for (const host::NamedValue& key : instance.path.keys)
      text += key.name + "=" + key.value.display() + ";";
    for (const host::NamedValue& each : instance.properties)
      if (each.value.type() != CMPI_dateTime)
        text += " " + each.name + "=" + each.value.display() + ";";
    return text;
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
  tvxsim_hold_clock(1);
  load();
  const Census expected = census();
  EXPECT_EQ(expected.at("TVXHBA_FCPort").size(), 4U);
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
  tvxsim_hold_clock(1);
  load();
  const Census expected = census();
  unload();
  for (const KeyForm form :
       {KeyForm::Declared, KeyForm::Unsigned64, KeyForm::Signed64, KeyForm::Text}) {
    BrokerOptions options;
    options.keys = form;
    load(options);
    EXPECT_EQ(census(), expected);
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
    for (const host::MethodData& method : host::methods(*classes->find(name))) {
      EXPECT_NE(method.returnType, CMPI_ref) << name << "." << method.name;
      if (names.paths.empty()) continue;
      const Reply reply = broker->invokeMethod(names.paths.front(), method.name);
      if (reply.status.rc != CMPI_RC_OK) continue;
      EXPECT_NE(reply.returnValue.type(), CMPI_null) << name << "." << method.name;
      for (const host::NamedValue& output : reply.outputs)
        EXPECT_NE(output.value.type(), CMPI_null) << name << "." << method.name << output.name;
      ++answered;
    }
  }
  EXPECT_GT(answered, 10U);
}

TEST_F(Server_Behaviours, APropertyWithoutAValueIsLeftUnset) {
  load();
  std::size_t seen = 0;
  for (const std::string& name : servedClasses())
    for (const host::Instance& instance : instances(name)) {
      for (const host::NamedValue& each : instance.properties) {
        EXPECT_NE(each.value.type(), CMPI_null) << name << "." << each.name;
        EXPECT_FALSE(each.value.isNull()) << name << "." << each.name;
        ++seen;
      }
      for (const host::NamedValue& key : instance.path.keys)
        EXPECT_FALSE(key.value.isNull()) << name << "." << key.name;
    }
  EXPECT_GT(seen, 1000U);
}

TEST_F(Server_Behaviours, EveryRequestMayHaveAThreadOfItsOwn) {
  load();
  std::atomic<std::size_t> good{0};
  for (const std::string& name : servedClasses()) {
    const auto ask = [&] { good += broker->enumerateInstances(name).status.rc == CMPI_RC_OK; };
    std::thread first(ask);
    std::thread second(ask);
    first.join();
    second.join();
  }
  EXPECT_EQ(good, 2 * servedClasses().size());
  EXPECT_EQ(broker->unload().rc, CMPI_RC_OK);
  EXPECT_FALSE(broker->stillMapped(TVX_PROVIDER_LIBRARY)) << "a thread's data keeps the library";
  broker.reset();
}

TEST_F(Server_Behaviours, APathWithoutNamespaceIsServed) {
  tvxsim_hold_clock(1);
  load();
  const Census expected = census();
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

/// The path with no namespace in it, nor in the paths that are its keys.
ObjectPath placeless(ObjectPath path) {
  path.nameSpace.clear();
  for (host::NamedValue& key : path.keys.items())
    if (key.value.type() == CMPI_ref)
      key.value = Value::reference(placeless(key.value.asReference()));
  return path;
}

TEST_F(Server_Behaviours, ReferencesWithoutNamespaceAreUnderstood) {
  for (const int version : {0, 200}) {
    BrokerOptions options;
    options.version = version;
    options.tellsNameSpace = false;
    load(options);
    std::size_t links = 0;
    for (const std::string& name : servedClasses()) {
      const Reply names = broker->enumerateInstanceNames(name);
      if (!classes->find(name)->isAssociation || names.paths.empty()) continue;
      EXPECT_EQ(broker->getInstance(placeless(names.paths[0])).status.rc, CMPI_RC_OK) << name;
      ++links;
    }
    EXPECT_GT(links, 60U);
    const auto path = [&](const char* name) {
      return placeless(broker->enumerateInstanceNames(name).paths.at(0));
    };
    const Reply called =
        broker->invokeMethod(path("TVXHBA_BootBIOSService"), "GetBootBIOSStatus",
                             {{"Target", Value::reference(path("TVXHBA_FCPort"))}});
    EXPECT_EQ(called.status.rc, CMPI_RC_OK);
    EXPECT_EQ(called.returnValue.asUnsigned(), 0U);
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

/// Clients that ask for one class each, all the time.
class Clients {
 public:
  explicit Clients(host::Broker& broker) : m_Broker(broker) {
    for (const char* name : {"TVXHBA_FCPort", "TVXHBA_Card", "TVXHBA_StorageVolume"})
      m_Threads.emplace_back([this, name] {
        while (!m_Over) {
          const int code = m_Broker.enumerateInstances(name).status.rc;
          // A request that comes after the unloading of its class is refused.
          if (code != CMPI_RC_OK && code != CMPI_RC_ERR_FAILED) ++wrong;
          ++answered;
        }
      });
  }
  void end() {
    m_Over = true;
    for (std::thread& each : m_Threads) each.join();
  }
  /// They go on until the process ends.
  void leave() {
    for (std::thread& each : m_Threads) each.detach();
  }

  std::atomic<std::size_t> answered{0};
  std::atomic<std::size_t> wrong{0};

 private:
  host::Broker& m_Broker;
  std::atomic<bool> m_Over{false};
  std::vector<std::thread> m_Threads;
};

TEST_F(Server_Behaviours, CleanupOnAnotherThreadWhileRequestsRunAndTheProcessEnds) {
  EXPECT_EQ(
      inChild([&] {
        // Until the first answer there is, every client stands inside the library.
        addFault(R"({"call": "HBA_GetNumberOfAdapters", "nth": 1, "delay_ms": 50})");
        load();
        for (const auto kind : {host::InterfaceKind::Association, host::InterfaceKind::Method})
          EXPECT_NE(broker->interface("TVXHBA_ControlledBy", kind), nullptr);
        Clients clients(*broker);
        while (tvxsim_calls("HBA_GetNumberOfAdapters", nullptr) == 0) std::this_thread::yield();
        EXPECT_EQ(clients.answered, 0U);
        std::thread server([&] { EXPECT_EQ(broker->cleanupOncePerKind(true).rc, CMPI_RC_OK); });
        server.join();
        const std::size_t before = clients.answered;
        while (clients.answered < before + 6) std::this_thread::yield();
        clients.end();
        EXPECT_EQ(clients.wrong, 0U);
        leaveBroker();
      }),
      0);
}

TEST_F(Server_Behaviours, TheProcessMayEndInTheMiddleOfRequests) {
  EXPECT_EQ(inChild([&] {
              // Registered first, run last: requests go on behind the library's own end.
              std::atexit([] { std::this_thread::sleep_for(std::chrono::milliseconds(30)); });
              load();
              static Clients* volatile clients = nullptr;
              clients = new Clients(*broker);
              while (clients->answered < 6) std::this_thread::yield();
              std::thread server([&] { broker->cleanupOncePerKind(true); });
              server.join();
              clients->leave();
              EXPECT_EQ(clients->wrong, 0U);
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

TEST_F(Server_Behaviours, TheLibraryMayBeOpenedForAllToSee) {
  EXPECT_EQ(inChild([&] {
              EXPECT_NE(dlopen(TVX_PROVIDER_LIBRARY, RTLD_NOW | RTLD_GLOBAL), nullptr);
              load();
              askForEverything();
              unload();
            }),
            0);
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

TEST_F(Server_Behaviours, ASmallStackIsEnoughForEveryRequest) {
  load();
  Request_Thread([this] { askForEverything(); });
}

}  // namespace
}  // namespace tvx::test
