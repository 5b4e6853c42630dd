// What clients read and change while the library runs: counters, the beacon, driver parameters,
// units with optimized access.
#include <string>
#include <vector>

#include "Provider_Fixture.h"
#include "tvxsim/tvxsim.h"

namespace tvx::test {
namespace {

constexpr const char* HOST = R"({
  "global_driver_params": [{"name": "log_level", "high": 9, "current": 3}],
  "cards": [
    {"serial_number": "A", "ports": [{"wwpn": "10000000000000A1",
      "statistics": {"crc_errors": [1, 2, 3, 4, 5, 6, 7, 8]},
      "driver_params": [{"name": "depth", "low": 1, "high": 512, "current": 30}],
      "targets": [{"wwpn": "50060E801049CF51", "luns": {"count": 1}}],
      "oas": [{"target": "50060E801049CF51", "lun": 9, "option": "config"}]}]},
    {"serial_number": "B", "ports": [{"wwpn": "10000000000000A2", "driver_params": []}]}]})";

class Live : public Provider_Test {
 protected:
  void SetUp() override {
    Provider_Test::SetUp();
    useScenario(HOST);
    load();
  }
  host::Instance port(std::size_t i) { return instances("TVXHBA_FCPort").at(i); }
  host::ObjectPath service() { return instances("TVXHBA_FCHBADriverParamService").at(0).path; }
  host::Instance unit(const std::string& id) {
    host::Instance instance;
    instance.path.className = "TVXHBA_DriverParams";
    instance.path.nameSpace = "root/torvex";
    instance.path.keys.set("InstanceID", host::Value::string(id));
    instance.properties.set("InstanceID", host::Value::string(id));
    return instance;
  }
  std::vector<std::string> parameters() {
    std::vector<std::string> ids;
    for (const host::Instance& each : instances("TVXHBA_DriverParams"))
      ids.push_back(each.text("InstanceID"));
    return ids;
  }
  std::uint64_t call(const std::string& method, const host::NamedValues& arguments) {
    const host::Reply reply = broker->invokeMethod(service(), method, arguments);
    EXPECT_EQ(reply.status.rc, CMPI_RC_OK) << reply.status.message;
    EXPECT_FALSE(reply.report.leaks()) << reply.report.text();
    return reply.returnValue.asUnsigned();
  }
  /// Takes the SAN's data in, which holds the marked units.
  void scan() { instances("TVXHBA_SCSIProtocolEndpoint"); }
};

TEST_F(Live, FailedReadAnswersNothingWithAGoodStatusAndServesTheRestNext) {
  instances("TVXHBA_FCPort");
  addFault(R"({"call": "LRM_GetPortStatistics", "port": "10000000000000A2", "status": 1})");
  EXPECT_TRUE(instances("TVXHBA_FCPortStatistics").empty());
  const std::vector<host::Instance> next = instances("TVXHBA_FCPortStatistics");
  ASSERT_EQ(next.size(), 2u);
  EXPECT_EQ(next[0].property("CRCErrors").asUnsigned(), 1u);
  EXPECT_EQ(next[1].properties.find("CRCErrors"), nullptr);
}

TEST_F(Live, BeaconIsSwitchedByModifyingThePort) {
  host::Instance wanted = port(0);
  wanted.properties.set("LocationIndicator", host::Value::number(CMPI_uint16, 2));
  host::Reply reply = broker->modifyInstance(wanted, std::vector<std::string>{"LocationIndicator"});
  EXPECT_EQ(reply.status.rc, CMPI_RC_OK) << reply.status.message;
  EXPECT_EQ(port(0).property("LocationIndicator").asUnsigned(), 2u);
  EXPECT_EQ(port(1).property("LocationIndicator").asUnsigned(), 3u);
  wanted.properties.set("LocationIndicator", host::Value::number(CMPI_uint16, 4));
  reply = broker->modifyInstance(wanted, std::vector<std::string>{"LocationIndicator"});
  EXPECT_EQ(reply.status.rc, CMPI_RC_ERR_INVALID_PARAMETER);
  reply = broker->modifyInstance(wanted, std::vector<std::string>{"ElementName"});
  EXPECT_EQ(reply.status.rc, CMPI_RC_ERR_INVALID_PARAMETER);
  EXPECT_EQ(port(0).property("LocationIndicator").asUnsigned(), 2u);
}

TEST_F(Live, ParameterIsSetThroughTheService) {
  ASSERT_EQ(instances("TVXHBA_DriverParams").at(0).property("current").asUnsigned(), 30u);
  const auto arguments = [this](const char* value) {
    return host::NamedValues{{"Target", host::Value::reference(port(0).path)},
                             {"bPermanent", host::Value::boolean(true)},
                             {"bGlobal", host::Value::boolean(false)},
                             {"strParam", host::Value::string("depth")},
                             {"strValue", host::Value::string(value)}};
  };
  EXPECT_EQ(call("SetDriverParameter", arguments("64")), 0u);
  EXPECT_EQ(call("SetDriverParameter", arguments("9999")), 40001u);
  EXPECT_EQ(call("SetDriverParameter", {{"strParam", host::Value::string("depth")}}), 32968u);
  EXPECT_EQ(tvxsim_calls("LRM_SetDriverParam", "10000000000000A1"), 2u);
  EXPECT_EQ(instances("TVXHBA_DriverParamGlobal").at(0).property("current").asUnsigned(), 3u);
}

TEST_F(Live, UnitsAreCreatedListedAndDeleted) {
  scan();
  EXPECT_EQ(parameters(),
            (std::vector<std::string>{"10000000000000A1:depth",
                                      "TVX:OAS:Config:10000000000000A1:50060E801049CF51:9"}));
  const host::Instance made = unit("TVX:OAS:Driver:10000000000000A1:50060E801049CF51:3");
  host::Reply reply = broker->createInstance(made);
  ASSERT_EQ(reply.status.rc, CMPI_RC_OK) << reply.status.message;
  ASSERT_EQ(reply.paths.size(), 1u);
  EXPECT_EQ(reply.paths[0].key("InstanceID").asText(), made.text("InstanceID"));
  EXPECT_EQ(parameters().size(), 3u);
  EXPECT_EQ(broker->createInstance(made).status.rc, CMPI_RC_ERR_ALREADY_EXISTS);
  EXPECT_EQ(broker->createInstance(unit("nothing")).status.rc, CMPI_RC_ERR_INVALID_PARAMETER);
  EXPECT_EQ(broker->createInstance(unit("TVX:OAS:Driver:")).status.rc, CMPI_RC_ERR_FAILED);
  const std::vector<host::Instance> tied =
      broker->associators(port(0).path, "TVXHBA_DriverParameterAffectsFCPort").instances;
  ASSERT_EQ(tied.size(), 1u);
  EXPECT_EQ(tied[0].text("InstanceID"), made.text("InstanceID"));
  EXPECT_EQ(tied[0].property("current").asUnsigned(), 1u);
  EXPECT_EQ(broker->deleteInstance(made.path).status.rc, CMPI_RC_OK);
  EXPECT_EQ(broker->deleteInstance(made.path).status.rc, CMPI_RC_ERR_NOT_FOUND);
  EXPECT_EQ(broker->deleteInstance(unit("10000000000000A1:depth").path).status.rc,
            CMPI_RC_ERR_FAILED);
  EXPECT_EQ(parameters().size(), 2u);
  EXPECT_TRUE(instances("TVXHBA_DriverParameterAffectsFCPort").empty());
}

TEST_F(Live, ChipTellsWhetherItSupportsOptimizedAccess) {
  scan();
  const std::vector<host::Instance> chips = instances("TVXHBA_Chip");
  EXPECT_EQ(chips.at(0).property("OASCapability").asSigned(), 1);
  EXPECT_EQ(chips.at(1).property("OASCapability").asSigned(), 0) << "nothing lies behind it";
}

TEST_F(Live, UnitsOfATargetAreSwitchedOffByTheService) {
  scan();
  EXPECT_EQ(call("DisableAllOASLuns", {{"InitiatorWWPN", host::Value::string("10000000000000A1")},
                                       {"TargetWWPN", host::Value::string("50060E801049CF51")}}),
            0u);
  EXPECT_EQ(parameters(), std::vector<std::string>{"10000000000000A1:depth"});
  EXPECT_EQ(call("DisableAllOASLuns", {}), 32968u);
}

TEST_F(Live, ServiceOfAnotherNameIsNotKnown) {
  host::ObjectPath path = service();
  path.keys.set("Name", host::Value::string("another"));
  const host::Reply reply = broker->invokeMethod(path, "DisableAllOASLuns");
  EXPECT_EQ(reply.status.rc, CMPI_RC_OK);
  EXPECT_EQ(reply.returnValue.asUnsigned(), 33068u);
}

}  // namespace
}  // namespace tvx::test
