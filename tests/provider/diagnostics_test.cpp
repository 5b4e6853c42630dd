// Diagnostic tests, their help, jobs and records through the built library, as a client sees them.
#include <algorithm>
#include <chrono>
#include <string>
#include <thread>
#include <vector>

#include "Provider_Fixture.h"

namespace tvx::test {
namespace {

using host::Value;

constexpr std::uint64_t NO_RESULT = 99999;
constexpr const char* STATUS_TEST = "TVX:FCHBA Status Test";
constexpr const char* HOST_TEST = "TVX:FCHBA Host Loopback Test";
constexpr const char* PORT = "10000000000000A1";

class Diagnostics : public Provider_Test {
 protected:
  void SetUp() override {
    Provider_Test::SetUp();
    useScenario(R"({"cards": [{"serial_number": "S1", "ports": [
        {"wwpn": "10000000000000A1", "wwnn": "20000000000000A1",
         "wwn_management": {"activation": "reset", "capability": 12}}]}]})");
    load();
  }
  /// The instance of a class whose property has that text.
  host::Instance one(const std::string& className, const char* property, const std::string& text) {
    const auto all = instances(className);
    const auto found = std::find_if(all.begin(), all.end(), [&](const host::Instance& each) {
      return each.text(property) == text;
    });
    EXPECT_NE(found, all.end()) << "no " << className << " " << text;
    return found != all.end() ? *found : host::Instance();
  }
  std::uint64_t call(const host::ObjectPath& path, const char* method,
                     host::NamedValues arguments = {}) {
    reply = broker->invokeMethod(path, method, std::move(arguments));
    EXPECT_EQ(reply.status.rc, CMPI_RC_OK) << method << ": " << reply.status.message;
    EXPECT_FALSE(reply.report.leaks()) << reply.report.text();
    return reply.returnValue.isNull() ? NO_RESULT : reply.returnValue.asUnsigned();
  }
  std::uint64_t run(const std::string& test, host::NamedValues arguments = {}) {
    arguments.set("ManagedElement",
                  Value::reference(one("TVXHBA_PortController", "DeviceID", PORT).path));
    return call(one("TVXHBA_FCHBADiagnosticTest", "Name", test).path, "RunDiagnosticService",
                std::move(arguments));
  }
  std::uint64_t help(const char* document, std::uint64_t format, std::uint64_t delivery) {
    return call(one("TVXHBA_HelpService", "Name", STATUS_TEST).path, "GetHelp",
                {{"RequestedDocument", Value::string(document)},
                 {"Format", Value::number(CMPI_uint16, format)},
                 {"RequestedDelivery", Value::number(CMPI_uint16, delivery)}});
  }
  static host::NamedValues cycles(const char* count) {
    host::Instance settings;
    settings.path.className = "TVXHBA_FCHBADiagnosticSettingData";
    settings.path.nameSpace = "root/torvex";
    settings.path.keys.set("InstanceID", Value::string(HOST_TEST));
    settings.properties.set("InstanceID", Value::string(HOST_TEST));
    settings.properties.set("LoopControlParameter",
                            Value::array(CMPI_string, {Value::string(count)}));
    return {{"DiagnosticSettings", Value::embedded(std::move(settings))}};
  }
  std::string settingOfTheHostTest() {
    const host::Instance settings =
        one("TVXHBA_FCHBADiagnosticSettingData", "InstanceID", HOST_TEST);
    const Value& counts = settings.property("LoopControlParameter");
    return counts.isNull() ? "(null)" : counts.asTextList().at(0);
  }
  std::size_t count(const char* className) { return instances(className).size(); }
  /// The InstanceIDs of what an association leads to, in alphabetical order.
  std::vector<std::string> behind(const host::ObjectPath& path, const char* association,
                                  const char* property = "InstanceID") {
    const host::Reply found = broker->associators(path, association);
    EXPECT_EQ(found.status.rc, CMPI_RC_OK) << association << ": " << found.status.message;
    EXPECT_FALSE(found.report.leaks()) << found.report.text();
    std::vector<std::string> texts;
    for (const host::Instance& each : found.instances) texts.push_back(each.text(property));
    std::sort(texts.begin(), texts.end());
    return texts;
  }

  host::Reply reply;
};

TEST_F(Diagnostics, HelpIsGivenAsTextAlone) {
  EXPECT_EQ(help(STATUS_TEST, 1, 1), 0u);
  const Value* const text = reply.outputs.find("DocumentInfo");
  ASSERT_TRUE(text != nullptr && !text->isNull());
  EXPECT_EQ(text->asText(), one("TVXHBA_HelpService", "Name", STATUS_TEST)
                                .property("DocumentDescriptions")
                                .asTextList()
                                .at(0));
  EXPECT_EQ(help("no such document", 1, 1), 4u);
  EXPECT_EQ(help(STATUS_TEST, 2, 1), 5u);
  EXPECT_EQ(help(STATUS_TEST, 1, 2), 5u);
}

TEST_F(Diagnostics, ARunLeavesItsJobAndRecords) {
  ASSERT_EQ(run(STATUS_TEST), 0u);
  const Value* const job = reply.outputs.find("Job");
  ASSERT_TRUE(job != nullptr && !job->isNull());
  const host::Instance finished = instances("TVXHBA_ConcreteJob").at(0);
  EXPECT_EQ(job->display(), Value::reference(finished.path).display());
  EXPECT_EQ(finished.property("PercentComplete").asUnsigned(), 100u);
  const host::Instance completion = instances("TVXHBA_DiagnosticCompletionRecord").at(0);
  EXPECT_EQ(completion.property("CompletionState").asUnsigned(), 2u);
  EXPECT_EQ(completion.text("ServiceName"), STATUS_TEST);
  EXPECT_EQ(completion.text("RecordData"), "TVX:FCHBA Status Test Resulted with Success");
  EXPECT_EQ(count("TVXHBA_DiagnosticServiceRecord"), 1u);
  EXPECT_EQ(count("TVXHBA_OwningJobElement"), 1u);
  EXPECT_EQ(count("TVXHBA_AffectedJobElement"), 1u);
}

TEST_F(Diagnostics, ResultsAreFoundFromTheLogThePortAndTheJob) {
  using Texts = std::vector<std::string>;
  ASSERT_EQ(run(STATUS_TEST), 0u);
  ASSERT_EQ(run(HOST_TEST, cycles("7")), 0u);
  const host::ObjectPath job = one("TVXHBA_ConcreteJob", "Name", HOST_TEST).path;
  const std::string id = job.key("InstanceID").asText();
  const Texts all = {id, id + ":Service Record", id + ":SettingData Record"};
  EXPECT_EQ(
      behind(one("TVXHBA_DiagnosticsLog", "InstanceID", HOST_TEST).path, "TVXHBA_LogManagesRecord"),
      all);
  const Texts ofThePort =
      behind(one("TVXHBA_PortController", "DeviceID", PORT).path, "TVXHBA_RecordAppliesToElement");
  EXPECT_EQ(ofThePort.size(), 2u + 3u) << "of both runs";
  EXPECT_TRUE(std::includes(ofThePort.begin(), ofThePort.end(), all.begin(), all.end()));
  EXPECT_EQ(behind(job, "TVXHBA_OwningJobElement", "Name"), Texts{HOST_TEST});
  EXPECT_EQ(behind(job, "TVXHBA_AffectedJobElement", "DeviceID"), Texts{PORT});
  const host::Instance settings = one("TVXHBA_DiagnosticSettingDataRecord", "Caption", id);
  EXPECT_EQ(behind(settings.path, "TVXHBA_CorrespondingSettingDataRecord"),
            (Texts{id, id + ":Service Record"}));
  const host::Instance& used = settings.property("Settings").asInstance();
  EXPECT_EQ(used.text("InstanceID"), HOST_TEST);
  EXPECT_EQ(used.property("LoopControlParameter").asTextList(), Texts{"7"});
}

TEST_F(Diagnostics, ClearingALogTakesTheRecordsOfItsTest) {
  ASSERT_EQ(run(STATUS_TEST), 0u);
  EXPECT_EQ(call(one("TVXHBA_DiagnosticsLog", "InstanceID", HOST_TEST).path, "ClearLog"), 0u);
  EXPECT_EQ(count("TVXHBA_DiagnosticCompletionRecord"), 1u);
  EXPECT_EQ(call(one("TVXHBA_DiagnosticsLog", "InstanceID", STATUS_TEST).path, "ClearLog"), 0u);
  EXPECT_EQ(count("TVXHBA_DiagnosticCompletionRecord"), 0u);
  EXPECT_EQ(count("TVXHBA_DiagnosticServiceRecord"), 0u);
}

TEST_F(Diagnostics, ARunWantsAPortController) {
  const host::ObjectPath test = one("TVXHBA_FCHBADiagnosticTest", "Name", STATUS_TEST).path;
  EXPECT_EQ(call(test, "RunDiagnosticService"), 5u);
  const host::ObjectPath port = instances("TVXHBA_FCPort").at(0).path;
  EXPECT_EQ(call(test, "RunDiagnosticService", {{"ManagedElement", Value::reference(port)}}), 5u);
  EXPECT_EQ(count("TVXHBA_ConcreteJob"), 0u);
}

TEST_F(Diagnostics, ARefreshMakesTheTestsNewAndLeavesJobsAndRecords) {
  const std::string before = settingOfTheHostTest();
  addFault(R"({"call": "LRM_DiagPciLoopBackTestV2", "status": 1})");
  EXPECT_EQ(run(HOST_TEST, cycles("7")), 40001u);
  EXPECT_EQ(settingOfTheHostTest(), "7") << "what a run was given stays for the next";
  ASSERT_EQ(run(STATUS_TEST), 0u);
  const host::Instance record = instances("TVXHBA_DiagnosticCompletionRecord").at(0);
  ASSERT_EQ(call(instances("TVXHBA_FCHBAWWNService").at(0).path, "ChangeWWN",
                 {{"Target", Value::reference(instances("TVXHBA_FCPort").at(0).path)},
                  {"NewWWPN", Value::string("1000000000000B01")},
                  {"NewWWNN", Value::string("2000000000000B01")},
                  {"Type", Value::number(CMPI_uint16, 1)}}),
            0u);
  // The refresh runs in the background; readers that come before it has begun get what was there.
  for (int tries = 0; tries < 1000 && settingOfTheHostTest() != before; tries++)
    std::this_thread::sleep_for(std::chrono::milliseconds(2));
  EXPECT_EQ(settingOfTheHostTest(), before);
  EXPECT_EQ(count("TVXHBA_FCHBADiagnosticTest"), 9u);
  EXPECT_EQ(count("TVXHBA_ConcreteJob"), 1u);
  EXPECT_EQ(count("TVXHBA_DiagnosticServiceRecord"), 1u);
  const auto records = instances("TVXHBA_DiagnosticCompletionRecord");
  ASSERT_EQ(records.size(), 1u);
  EXPECT_EQ(records[0].text("InstanceID"), record.text("InstanceID"));
}

}  // namespace
}  // namespace tvx::test
