// Firmware through the built library, as a client sees it.
#include <unistd.h>

#include <chrono>
#include <cstdlib>
#include <filesystem>
#include <functional>
#include <string>
#include <thread>
#include <vector>

#include "Provider_Fixture.h"
#include "support/Firmware_File.h"
#include "support/Full_Disk.h"
#include "support/Loopback_Servers.h"
#include "support/System_Curl.h"
#include "support/Working_Folder.h"
#include "tvxsim/tvxsim.h"

namespace tvx::test {
namespace {

using host::Value;
using Numbers = std::vector<std::uint64_t>;
using Texts = std::vector<std::string>;

constexpr const char* HOST = R"({"cards": [
  {"model": "TVX16002", "serial_number": "A", "firmware_version": "2.01a4",
   "ports": [{"wwpn": "10000000000000A1"}]},
  {"model": "TVX8102", "serial_number": "B", "firmware_version": "1.12a7",
   "ports": [{"wwpn": "10000000000000B1", "firmware": {"activation": "reboot"}}]}]})";

class Firmware : public Provider_Test {
 protected:
  static void SetUpTestSuite() { ASSERT_TRUE(keepSystemCurl()); }

  void SetUp() override {
    Provider_Test::SetUp();
    useScenario(HOST);
    load();
    ::unsetenv("http_proxy");
    service = instances("TVXHBA_SoftwareInstallationService").at(0).path;
    target = instances("TVXHBA_FCPort").at(0).path;
    folder.write("image.fw", firmwareImage("2.02a1", "TVX16"));
  }

  static Value numbers(CMPIType type, const Numbers& values) {
    Value::List list;
    for (const std::uint64_t value : values) list.push_back(Value::number(type, value));
    return Value::array(type, std::move(list));
  }
  static Value texts(const Texts& values) {
    Value::List list;
    for (const std::string& value : values) list.push_back(Value::string(value));
    return Value::array(CMPI_string, std::move(list));
  }
  static Value bytes(const std::string& content) {
    Value::List list;
    list.reserve(content.size());
    for (const char c : content)
      list.push_back(Value::number(CMPI_uint8, static_cast<unsigned char>(c)));
    return Value::array(CMPI_uint8, std::move(list));
  }

  std::uint64_t call(const std::string& method, const host::NamedValues& arguments) {
    reply = broker->invokeMethod(service, method, arguments);
    EXPECT_EQ(reply.status.rc, CMPI_RC_OK) << reply.status.message;
    EXPECT_FALSE(reply.report.leaks()) << reply.report.text();
    return reply.returnValue.isNull() ? 99999 : reply.returnValue.asUnsigned();
  }
  std::uint64_t fromURI(const std::string& uri, const Numbers& options = {}) {
    return call("InstallFromURI", {{"URI", Value::string(uri)},
                                   {"Target", Value::reference(target)},
                                   {"InstallOptions", numbers(CMPI_uint16, options)},
                                   {"InstallOptionsValues", texts({})}});
  }
  std::uint64_t fromBytes(const std::string& image, const Numbers& options, const Texts& values) {
    return call("InstallFromByteStream", {{"Image", bytes(image)},
                                          {"Target", Value::reference(target)},
                                          {"InstallOptions", numbers(CMPI_uint16, options)},
                                          {"InstallOptionsValues", texts(values)}});
  }
  /// True once it holds. A refresh that a method asked for runs in the background: it has files
  /// open for a moment, and readers that come before it has begun get the cache as it was.
  static bool soon(const std::function<bool()>& holds) {
    for (int tries = 0; tries < 10'000 && !holds(); tries++)
      std::this_thread::sleep_for(std::chrono::milliseconds(2));
    return holds();
  }
  static bool isBackTo(std::size_t descriptors) {
    return soon([=] { return openDescriptors() <= descriptors; });
  }
  /// `FirmwareOnFlash` of the port's identity.
  std::string onFlash(const std::string& wwpn) {
    for (const host::Instance& identity : instances("TVXHBA_SoftwareIdentity"))
      if (identity.text("PortWWN") == wwpn) return identity.text("FirmwareOnFlash");
    return "(no identity)";
  }

  Working_Folder folder;
  host::ObjectPath service;
  host::ObjectPath target;
  host::Reply reply;
};

TEST_F(Firmware, GoesFromAFileToTheFlashAndWithAResetIntoOperation) {
  EXPECT_EQ(fromURI("file://" + folder.path("image.fw"), {2}), 0u);
  EXPECT_EQ(onFlash("10000000000000A1"), "2.02a1");
  EXPECT_EQ(onFlash("10000000000000B1"), "1.12a7");
  EXPECT_EQ(call("ResetHBA", {{"Target", Value::reference(target)}}), 0u);
  EXPECT_TRUE(soon(
      [&] { return instances("TVXHBA_FCPort").at(0).text("OperationalFirmware") == "2.02a1"; }));
  EXPECT_EQ(instances("TVXHBA_FCPort").at(0).text("ElementName"),
            "Torvex TVX16002 firmware 2.02a1 driver 5.2.18.4 PORT-0");
  EXPECT_EQ(instances("TVXHBA_PortController").at(0).text("ElementName"),
            "Torvex TVX16002 firmware 2.02a1 driver 5.2.18.4");
}

TEST_F(Firmware, GoesFromAServerToTheFlashAndLeavesNothingBehind) {
  Http_Server server;
  server.put("new.fw", firmwareImage("2.02a2", "TVX16", 200'000));
  EXPECT_EQ(fromURI(server.url("new.fw")), 0u);
  const std::size_t before = openDescriptors();
  EXPECT_EQ(fromURI(server.url("new.fw"), {2, 11}), 0u);
  EXPECT_TRUE(isBackTo(before));
  EXPECT_EQ(onFlash("10000000000000A1"), "2.02a2");
  EXPECT_EQ(folder.files(), Texts{"image.fw"});
}

TEST_F(Firmware, ThatNeedsARebootIsToldInThePort) {
  target = instances("TVXHBA_FCPort").at(1).path;
  folder.write("small.fw", firmwareImage("1.13a1", "TVX8"));
  EXPECT_EQ(fromURI(folder.path("small.fw"), {2}), 0u);
  EXPECT_EQ(instances("TVXHBA_FCPort").at(1).property("FWDownloadStatus").asUnsigned(), 40247u);
  EXPECT_EQ(onFlash("10000000000000B1"), "1.13a1");
}

TEST_F(Firmware, ComesWithTheCallToo) {
  const std::size_t before = openDescriptors();
  EXPECT_EQ(fromBytes(firmwareImage("2.02a3", "", 100'000), {32768}, {folder.path("stream.fw")}),
            0u);
  EXPECT_TRUE(isBackTo(before));
  EXPECT_TRUE(soon([&] { return onFlash("10000000000000A1") == "2.02a3"; }));
  EXPECT_EQ(folder.files(), Texts{"image.fw"});
}

TEST_F(Firmware, BadInputIsAnsweredAndNothingIsLeftOpen) {
  fromURI("http://127.0.0.1:1/first");  // what libcurl sets up once stays
  const std::size_t before = openDescriptors();
  const struct {
    std::string uri;
    Numbers options;
    std::uint64_t result;
  } uris[] = {
      {"", {}, 4097},
      {" ", {}, 4107},
      {"nothing", {}, 4107},
      {"..", {}, 40026},
      {"http://127.0.0.1:1/..", {}, 40026},
      {"http://127.0.0.1:1/%2e%2e", {}, 4107},
      {"http://127.0.0.1:1/%s%n with blank", {}, 4107},
      {"http://127.0.0.1:bad/x", {}, 4107},
      {"http://", {}, 4107},
      {"strange://127.0.0.1/x", {}, 4107},
      {"file:///no/such/x", {}, 4107},
      {folder.path("image.fw/more"), {}, 4107},
      {std::string(5000, 'x'), {}, 5},
      {folder.path("image.fw"), {3}, 5},
      {folder.path("image.fw"), {65535}, 5},
      {folder.path("image.fw"), {2, 32768}, 5},
  };
  for (const auto& row : uris)
    EXPECT_EQ(fromURI(row.uri, row.options), row.result) << row.uri.substr(0, 80);
  EXPECT_EQ(fromBytes("", {32768}, {"stream.fw"}), 40145u);
  EXPECT_EQ(fromBytes("x", {2, 32768}, {"stream.fw"}), 5u);
  EXPECT_EQ(fromBytes("x", {32768}, {}), 5u);
  EXPECT_EQ(fromBytes("x", {32768}, {folder.path("none/stream.fw")}), 4u);
  EXPECT_TRUE(isBackTo(before));
  EXPECT_EQ(instances("TVXHBA_FCPort").size(), 2u);
  EXPECT_EQ(fromURI(folder.path("image.fw")), 0u);
}

/// While it lives, the whole process may do no more than an account without rights.
class Without_Rights {
 public:
  Without_Rights() : m_Before(::geteuid()) {
    if (m_Before == 0 && ::seteuid(65534) != 0) std::abort();
  }
  ~Without_Rights() {
    if (m_Before == 0 && ::seteuid(0) != 0) std::abort();
  }
  Without_Rights(const Without_Rights&) = delete;
  Without_Rights& operator=(const Without_Rights&) = delete;

 private:
  uid_t m_Before;
};

TEST_F(Firmware, AFileThatCannotBeReadIsTheLibrarysRefusal) {
  const std::string image = folder.path("image.fw");
  std::filesystem::permissions(folder.path(""), std::filesystem::perms(0755));
  std::filesystem::permissions(image, std::filesystem::perms::none);
  {
    const Without_Rights rights;
    EXPECT_EQ(fromURI(image), 40026u);
  }
  EXPECT_TRUE(std::filesystem::exists(image));
  std::filesystem::permissions(image, std::filesystem::perms(0600));
  EXPECT_EQ(fromURI(image), 0u);
}

TEST_F(Firmware, AnotherTargetOrNoneIsAnswered) {
  const host::ObjectPath port = target;
  target = service;
  EXPECT_EQ(fromURI(folder.path("image.fw")), 32968u);
  EXPECT_EQ(fromBytes("x", {32768}, {"stream.fw"}), 32968u);
  target = instances("TVXHBA_Card").at(0).path;
  EXPECT_EQ(fromURI(folder.path("image.fw")), 32968u);
  target = port;
  target.keys.set("DeviceID", Value::string("10000000000000FF"));
  EXPECT_EQ(fromURI(folder.path("image.fw")), 32968u);
  EXPECT_EQ(call("InstallFromURI", {{"URI", Value::string(folder.path("image.fw"))}}), 4097u);
  EXPECT_EQ(call("InstallFromByteStream", {}), 4097u);
  EXPECT_EQ(call("ResetHBA", {}), 32968u);
  EXPECT_EQ(call("GetHBAFeatures", {}), 32968u);
  EXPECT_EQ(call("SetPortEnabled", {}), 32968u);
  EXPECT_EQ(call("SetFECState", {}), 32968u);
  EXPECT_EQ(call("InstallFromURI", {{"URI", Value::string(folder.path("image.fw"))},
                                    {"Target", Value::reference(port)}}),
            0u);
  service.keys.set("Name", Value::string("another"));
  target = port;
  EXPECT_EQ(fromURI(folder.path("image.fw")), 33068u);
  EXPECT_EQ(call("ResetHBA", {{"Target", Value::reference(target)}}), 33068u);
}

TEST_F(Firmware, AFullDiskIsAnsweredAndOtherRequestsAreServed) {
  Http_Server server;
  server.put("new.fw", firmwareImage("2.02a2", "TVX16", 200'000));
  {
    const Full_Disk disk(4096);
    EXPECT_EQ(fromURI(server.url("new.fw")), 4107u);
    EXPECT_EQ(fromBytes(firmwareImage("2.02a3", "", 100'000), {32768}, {"stream.fw"}), 4u);
  }
  EXPECT_EQ(instances("TVXHBA_FCPort").size(), 2u);
  EXPECT_EQ(fromURI(server.url("new.fw")), 0u);
}

TEST_F(Firmware, TheSettingsOfAPortAnswerTheirOutputs) {
  EXPECT_EQ(call("SetPortEnabled",
                 {{"Target", Value::reference(target)}, {"PortEnabled", Value::boolean(false)}}),
            0u);
  ASSERT_NE(reply.outputs.find("ConfigStatus"), nullptr);
  EXPECT_EQ(reply.outputs.find("ConfigStatus")->asUnsigned(), 5u);
  EXPECT_EQ(call("SetFECState",
                 {{"Target", Value::reference(target)}, {"EnableFlag", Value::boolean(true)}}),
            0u);
  EXPECT_EQ(instances("TVXHBA_FCPort").at(0).property("FECState").asUnsigned(), 1u);
  EXPECT_EQ(call("GetHBAFeatures", {{"Target", Value::reference(target)}}), 0u);
  ASSERT_NE(reply.outputs.find("Features"), nullptr);
  EXPECT_EQ(reply.outputs.find("Features")->elements().size(), 512u);
}

TEST_F(Firmware, TheOtherMethodsOfTheServiceAreNotSupported) {
  for (const char* method : {"CheckSoftwareIdentity", "InstallFromSoftwareIdentity",
                             "RequestStateChange", "StartService", "StopService"})
    EXPECT_EQ(broker->invokeMethod(service, method, {}).status.rc, CMPI_RC_ERR_NOT_SUPPORTED)
        << method;
}

}  // namespace
}  // namespace tvx::test
