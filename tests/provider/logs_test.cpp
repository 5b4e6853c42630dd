// Logs and settings as a client sees them.
#include <filesystem>
#include <string>
#include <thread>
#include <vector>

#include "Provider_Fixture.h"
#include "tvxsim/tvxsim.h"

namespace tvx::test {
namespace {

class Logs : public Provider_Test {
 protected:
  void SetUp() override {
    Provider_Test::SetUp();
    std::filesystem::create_directories(root / "var/log");
    writeFile("etc/torvex_fc_provider.dmp", "1,3,1\n");
    writeFile("var/log/messages", "kernel: tvfc 0: one\nkernel: other\nkernel: tvfc 0: two\n");
    load();
  }

  host::Instance log(const std::string& prefix) {
    for (host::Instance& each : instances("TVXHBA_RecordLog"))
      if (each.text("InstanceID").starts_with(prefix)) return std::move(each);
    ADD_FAILURE() << "no log " << prefix;
    return {};
  }
  host::Instance providerLog() { return log("TVXHBA:ProviderLog:"); }
  host::Instance driverLog() { return log("TVX: FC Driver Record Log:"); }

  host::Reply call(const host::Instance& on, const std::string& method,
                   host::NamedValues arguments) {
    host::Reply reply = broker->invokeMethod(on.path, method, std::move(arguments));
    EXPECT_FALSE(reply.report.leaks()) << reply.report.text();
    return reply;
  }
  static host::NamedValues state(std::uint64_t value) {
    return {{"RequestedState", host::Value::number(CMPI_uint16, value)}};
  }
  int change(const std::string& name, std::uint64_t value) {
    host::Instance setting;
    setting.path.nameSpace = "root/torvex";
    setting.path.className = "TVXHBA_ProviderConfigSetting";
    const auto id = host::Value::string("Torvex HBA Provider:" + name);
    setting.path.keys.set("InstanceID", id);
    setting.properties.set("InstanceID", id);
    setting.properties.set("current", host::Value::number(CMPI_uint32, value));
    return broker->modifyInstance(setting, {{"current"}}).status.rc;
  }
  static host::NamedValues params(std::uint64_t level, std::uint64_t mode,
                                  const std::string& path) {
    return {{"LogLevel", host::Value::number(CMPI_uint16, level)},
            {"LogMode", host::Value::number(CMPI_uint16, mode)},
            {"TracePath", host::Value::string(path)}};
  }
};

TEST_F(Logs, ParametersAreSetAndShown) {
  const std::string path = (root / "var/log/trace.log").string();
  const host::Reply reply = call(providerLog(), "SetLogParams", params(4, 4, path));
  EXPECT_EQ(reply.status.rc, CMPI_RC_OK);
  EXPECT_EQ(reply.returnValue.asUnsigned(), 0u);
  const host::Instance record = providerLog();
  EXPECT_EQ(record.text("TracePath"), path);
  EXPECT_EQ(record.property("LogLevel").asUnsigned(), 4u);
  EXPECT_EQ(record.property("LogMode").asUnsigned(), 4u);
  EXPECT_TRUE(std::filesystem::exists(path));
  EXPECT_EQ(call(providerLog(), "SetLogParams", params(6, 1, "")).returnValue.asUnsigned(),
            0x80C8u);
}

TEST_F(Logs, ParametersOfTheDriversLogAreNotSupported) {
  EXPECT_EQ(call(driverLog(), "SetLogParams", params(1, 1, "")).status.rc,
            CMPI_RC_ERR_NOT_SUPPORTED);
}

TEST_F(Logs, AnUnknownLogIsAnswered) {
  host::Instance other = providerLog();
  other.path.keys.set("InstanceID", host::Value::string("TVXHBA:ProviderLog:elsewhere"));
  EXPECT_EQ(call(other, "ClearLog", {}).returnValue.asUnsigned(), 0x812Cu);
  EXPECT_EQ(call(other, "RequestStateChange", state(2)).returnValue.asUnsigned(), 0x812Cu);
  EXPECT_EQ(call(other, "SetLogParams", params(1, 1, "")).returnValue.asUnsigned(), 0x812Cu);
}

TEST_F(Logs, RecordsLeadToTheirLogAndBack) {
  EXPECT_EQ(call(providerLog(), "SetLogParams", params(9, 1, "")).returnValue.asUnsigned(),
            0x80C8u);
  const std::vector<host::Instance> entries = instances("TVXHBA_LogEntry");
  ASSERT_FALSE(entries.empty());
  EXPECT_EQ(entries.back().text("RecordData"), "[Log level provided is out of range]");
  EXPECT_EQ(entries.back().text("LogLevel"), "3");
  EXPECT_EQ(instances("TVXHBA_RecordLogManagesRecord").size(), entries.size());
  const host::Instance record = providerLog();
  const host::Reply managed = broker->associators(record.path, "TVXHBA_RecordLogManagesRecord");
  ASSERT_EQ(managed.status.rc, CMPI_RC_OK);
  EXPECT_EQ(managed.instances.size(), entries.size());
  const host::Reply back =
      broker->associators(entries.front().path, "TVXHBA_RecordLogManagesRecord");
  ASSERT_EQ(back.instances.size(), 1u);
  EXPECT_EQ(back.instances[0].text("InstanceID"), record.text("InstanceID"));
  const host::Reply one = broker->getInstance(entries.back().path);
  ASSERT_EQ(one.status.rc, CMPI_RC_OK);
  EXPECT_EQ(one.instances.at(0).text("RecordData"), entries.back().text("RecordData"));
}

TEST_F(Logs, AClearedLogHasNoRecords) {
  ASSERT_FALSE(instances("TVXHBA_LogEntry").empty());
  EXPECT_EQ(call(providerLog(), "ClearLog", {}).returnValue.asUnsigned(), 0u);
  EXPECT_TRUE(instances("TVXHBA_LogEntry").empty());
  EXPECT_TRUE(instances("TVXHBA_RecordLogManagesRecord").empty());
}

TEST_F(Logs, TheDriversLinesAreReadByAnEnable) {
  EXPECT_TRUE(instances("TVXHBA_FCDriverLogEntry").empty());
  const host::Reply reply = call(driverLog(), "RequestStateChange", state(2));
  EXPECT_EQ(reply.status.rc, CMPI_RC_OK);
  EXPECT_EQ(reply.returnValue.asUnsigned(), 0u);
  const std::vector<host::Instance> entries = instances("TVXHBA_FCDriverLogEntry");
  ASSERT_EQ(entries.size(), 2u);
  EXPECT_EQ(entries[0].text("RecordData"), "kernel: tvfc 0: two");
  EXPECT_EQ(entries[1].text("RecordData"), "kernel: tvfc 0: one");
  EXPECT_EQ(driverLog().property("CurrentNumberOfRecords").asUnsigned(), 2u);
  EXPECT_EQ(driverLog().property("EnabledState").asUnsigned(), 2u);
  const host::Reply managed =
      broker->associators(driverLog().path, "TVXHBA_DriverRecordLogManagesRecord");
  EXPECT_EQ(managed.instances.size(), 2u);
  EXPECT_EQ(call(driverLog(), "ClearLog", {}).returnValue.asUnsigned(), 0u);
  EXPECT_TRUE(instances("TVXHBA_FCDriverLogEntry").empty());
  EXPECT_EQ(driverLog().property("CurrentNumberOfRecords").asUnsigned(), 0u);
}

TEST_F(Logs, ParametersAndStatesSurviveAReload) {
  const std::string path = (root / "var/log/trace.log").string();
  ASSERT_EQ(call(providerLog(), "SetLogParams", params(2, 4, path)).returnValue.asUnsigned(), 0u);
  ASSERT_EQ(call(providerLog(), "RequestStateChange", state(3)).returnValue.asUnsigned(), 0u);
  unload();
  load();
  const host::Instance record = providerLog();
  EXPECT_EQ(record.text("TracePath"), path);
  EXPECT_EQ(record.property("LogLevel").asUnsigned(), 2u);
  EXPECT_EQ(record.property("LogMode").asUnsigned(), 4u);
  EXPECT_EQ(record.property("EnabledState").asUnsigned(), 3u);
}

TEST_F(Logs, AChangeDuringARefreshWaitsAndThenHolds) {
  addFault(R"({"call": "LRM_GetDumpRetentionCount", "delay_ms": 30})");
  ASSERT_EQ(tvxsim_calls("LRM_GetDumpRetentionCount", nullptr), 0u);
  std::thread reader([this] { EXPECT_FALSE(instances("TVXHBA_Card").empty()); });
  // The maps are being built, and are about to be done with the first port.
  while (tvxsim_calls("LRM_GetDumpRetentionCount", nullptr) == 0) std::this_thread::yield();
  EXPECT_EQ(change("cachetimeout", 12), CMPI_RC_OK);
  const unsigned long built = tvxsim_calls("LRM_GetDumpRetentionCount", nullptr);
  reader.join();
  EXPECT_EQ(built, instances("TVXHBA_PortController").size()) << "it did not wait for the end";
  const host::Instance setting = instances("TVXHBA_ProviderConfigSetting").at(0);
  EXPECT_EQ(setting.property("current").asUnsigned(), 12u);
}

TEST_F(Logs, SettingsAreChangedWithinTheirRange) {
  EXPECT_EQ(change("cachetimeout", 30), CMPI_RC_OK);
  EXPECT_EQ(change("cachetimeout", 31), CMPI_RC_ERR_INVALID_PARAMETER);
  EXPECT_EQ(change("adapterrefresh", 2), CMPI_RC_ERR_INVALID_PARAMETER);
  EXPECT_EQ(change("nosuch", 1), CMPI_RC_ERR_FAILED);
  EXPECT_EQ(instances("TVXHBA_ProviderConfigSetting").at(0).property("current").asUnsigned(), 30u);
}

}  // namespace
}  // namespace tvx::test
