// Names, boot code and dumps through the built library, as a client sees them.
#include <chrono>
#include <string>
#include <thread>
#include <vector>

#include "Provider_Fixture.h"
#include "tvxsim/tvxsim.h"

namespace tvx::test {
namespace {

using host::Value;
using Texts = std::vector<std::string>;

class Management : public Provider_Test {
 protected:
  /// A host of two ports, the first with more members.
  void start(const std::string& members = {}) {
    useScenario(
        R"({"cards": [{"serial_number": "S1", "ports": [{"wwpn": "10000000000000A1",
            "wwnn": "20000000000000A1")" +
        (members.empty() ? "" : ", " + members) +
        R"(}, {"wwpn": "10000000000000A2", "wwnn": "20000000000000A2"}]}]})");
    load();
    target = instances("TVXHBA_FCPort").at(0).path;
  }
  std::uint64_t call(const std::string& className, const std::string& method,
                     host::NamedValues arguments = {}) {
    if (!target.className.empty()) arguments.set("Target", Value::reference(target));
    reply = broker->invokeMethod(instances(className).at(0).path, method, std::move(arguments));
    EXPECT_EQ(reply.status.rc, CMPI_RC_OK) << method << ": " << reply.status.message;
    EXPECT_FALSE(reply.report.leaks()) << reply.report.text();
    return reply.returnValue.isNull() ? 99999 : reply.returnValue.asUnsigned();
  }
  static host::NamedValues type(std::uint64_t value) {
    return {{"Type", Value::number(CMPI_uint16, value)}};
  }
  std::uint64_t changeNames(const std::string& wwpn, const std::string& wwnn) {
    return call(NAMES, "ChangeWWN",
                {{"NewWWPN", Value::string(wwpn)},
                 {"NewWWNN", Value::string(wwnn)},
                 {"Type", Value::number(CMPI_uint16, 1)}});
  }
  std::uint64_t output(const char* name) {
    const Value* const value = reply.outputs.find(name);
    return value == nullptr || value->isNull() ? 99999 : value->asUnsigned();
  }
  std::string text(const char* name) {
    const Value* const value = reply.outputs.find(name);
    return value == nullptr || value->isNull() ? "(null)" : value->asText();
  }
  Texts dumpFiles() {
    EXPECT_EQ(call(DUMPS, "GetDumpFileNames"), 0u);
    const Value* const files = reply.outputs.find("DumpFiles");
    return files == nullptr || files->isNull() ? Texts{"(null)"} : files->asTextList();
  }

  static constexpr const char* NAMES = "TVXHBA_FCHBAWWNService";
  static constexpr const char* BOOT = "TVXHBA_BootBIOSService";
  static constexpr const char* DUMPS = "TVXHBA_DumpService";
  host::ObjectPath target;
  host::Reply reply;
};

TEST_F(Management, NamesAreReadChangedAndRestored) {
  start(R"("wwn_management": {"activation": "reset", "capability": 12})");
  EXPECT_EQ(call(NAMES, "GetWWNCapability"), 0u);
  EXPECT_EQ(output("WWNCapability"), 12u);
  EXPECT_EQ(call(NAMES, "ReadWWN", type(3)), 0u);
  EXPECT_EQ(text("WWPN"), "10:00:00:00:00:00:00:a1");
  EXPECT_EQ(text("WWNN"), "20:00:00:00:00:00:00:a1");
  EXPECT_EQ(output("WWNOperationStatus"), 4u);
  EXPECT_EQ(call(NAMES, "ReadWWN", type(4)), 0u);
  EXPECT_EQ(text("WWPN"), "(null)");
  EXPECT_EQ(output("WWNOperationStatus"), 9u);
  EXPECT_EQ(changeNames("1000000000000B01", "2000000000000B01"), 0u);
  EXPECT_EQ(output("WWNOperationStatus"), 8u);
  EXPECT_EQ(call(NAMES, "ReadWWN", type(4)), 0u);
  EXPECT_EQ(text("WWPN"), "10:00:00:00:00:00:0b:01");
  EXPECT_EQ(call(NAMES, "RestoreWWN", type(0)), 0u);
  EXPECT_NE(output("WWNOperationStatus"), 65535u);
  EXPECT_EQ(call(NAMES, "ReadWWN", type(5)), 32968u);
  EXPECT_EQ(output("WWNOperationStatus"), 65535u);
}

TEST_F(Management, ANameOfAVirtualPortIsRefused) {
  start(R"("vports": [{"wwpn": "1000000000000B01", "wwnn": "2000000000000C01"}])");
  EXPECT_EQ(changeNames("1000000000000B01", "2000000000000B01"), 91u);
  EXPECT_EQ(output("WWNOperationStatus"), 1u);
  EXPECT_EQ(changeNames("1000000000000B02", "1000000000000B01"), 91u);
  EXPECT_EQ(changeNames("", "2000000000000B01"), 32969u);
  EXPECT_EQ(changeNames("100", "2000000000000B01"), 32968u);
  EXPECT_EQ(tvxsim_calls("RM_ChangeWWN", nullptr), 0u);
}

TEST_F(Management, AReaderOfAnotherClassWaitsForTheEndOfALongCall) {
  start();
  addFault(R"({"call": "RM_ChangeWWN", "delay_ms": 200, "status": 92})");
  using Clock = std::chrono::steady_clock;
  Clock::time_point changed;
  std::thread changer([&] {
    EXPECT_EQ(changeNames("1000000000000B01", "2000000000000B01"), 40092u);
    changed = Clock::now();
  });
  while (tvxsim_calls("RM_ChangeWWN", nullptr) == 0) std::this_thread::yield();
  EXPECT_EQ(instances("TVXHBA_Card").size(), 1u);
  const Clock::time_point read = Clock::now();
  changer.join();
  // Both end when the lock is given back; a reader that did not wait would be ahead by the delay.
  EXPECT_LT(changed - read, std::chrono::milliseconds(150));
}

TEST_F(Management, BootCodeIsSwitched) {
  start(R"("boot_code_enabled": false)");
  EXPECT_EQ(call(BOOT, "GetBootBIOSStatus"), 0u);
  EXPECT_EQ(output("nBootBIOSStatus"), 0u);
  EXPECT_EQ(call(BOOT, "EnableBootBIOS"), 0u);
  EXPECT_EQ(call(BOOT, "GetBootBIOSStatus"), 0u);
  EXPECT_EQ(output("nBootBIOSStatus"), 1u);
  EXPECT_EQ(call(BOOT, "DisableBootBIOS"), 0u);
  EXPECT_EQ(call(BOOT, "GetBootBIOSStatus"), 0u);
  EXPECT_EQ(output("nBootBIOSStatus"), 0u);
}

TEST_F(Management, DumpsAreMadeListedAndRemoved) {
  start(R"("dumps": {"files": ["core", "x", "", "a.log", "b.txt", "c.fat"]})");
  EXPECT_EQ(dumpFiles(), (Texts{"core", "b.txt", "c.fat"}));
  EXPECT_EQ(call(DUMPS, "GenerateDump"), 0u);
  EXPECT_EQ(dumpFiles().back(), "10000000000000A1_000001.dmp");
  EXPECT_EQ(call(DUMPS, "DeleteDump"), 0u);
  EXPECT_EQ(dumpFiles(), Texts{"(null)"});
}

TEST_F(Management, NumberOfDumpsIsChangedWithinItsRange) {
  start(R"("dumps": {"directory": "/var/dumps", "retention": 7})");
  const auto modify = [this](const char* property, const Value& value) {
    host::Instance setting = instances("TVXHBA_DumpData").at(0);
    setting.properties.set(property, value);
    return broker->modifyInstance(setting, {{property}}).status.rc;
  };
  const auto kept = [this] {
    return instances("TVXHBA_DumpData").at(0).property("RetentionCount").asUnsigned();
  };
  EXPECT_EQ(modify("RetentionCount", Value::number(CMPI_uint32, 20)), CMPI_RC_OK);
  EXPECT_EQ(kept(), 20u);
  EXPECT_EQ(modify("RetentionCount", Value::number(CMPI_uint32, 21)), CMPI_RC_ERR_FAILED);
  EXPECT_EQ(modify("RetentionCount", Value::number(CMPI_uint32, 0)), CMPI_RC_ERR_FAILED);
  EXPECT_EQ(modify("DumpDirectory", Value::string("/elsewhere")), CMPI_RC_ERR_NOT_SUPPORTED);
  EXPECT_EQ(modify("DumpDirectory", Value::string("/var/dumps")), CMPI_RC_OK);
  EXPECT_EQ(kept(), 20u);
  EXPECT_EQ(instances("TVXHBA_DumpData").size(), 2u);
}

TEST_F(Management, ATargetThatDoesNotFitOrIsMissingIsAnswered) {
  start();
  const host::ObjectPath port = target;
  const auto expectRefused = [this] {
    for (const char* method : {"ChangeWWN", "RestoreWWN", "ReadWWN", "GetWWNCapability"})
      EXPECT_EQ(call(NAMES, method), 32968u) << method;
    for (const char* method : {"EnableBootBIOS", "DisableBootBIOS", "GetBootBIOSStatus"})
      EXPECT_EQ(call(BOOT, method), 32968u) << method;
    for (const char* method : {"GenerateDump", "DeleteDump", "GetDumpFileNames"})
      EXPECT_EQ(call(DUMPS, method), 32968u) << method;
  };
  target = {};
  expectRefused();
  // A path of another class is as none, whatever its device is called.
  target = instances("TVXHBA_PortController").at(0).path;
  expectRefused();
  target = port;
  target.keys.set("DeviceID", Value::string("10000000000000FF"));
  expectRefused();
}

}  // namespace
}  // namespace tvx::test
