// Discovery over the simulated libraries, through the real dynamic linker.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "access/TVX_MethodWrapper.h"
#include "model/TVX_Data.h"
#include "support/Log_Capture.h"
#include "tvxsim/tvxsim.h"

namespace cimrt {
namespace {

using testing::ElementsAre;
using tvx::test::Log_Capture;

class Simulated_Host : public testing::Test {
 protected:
  void SetUp() override {
    ASSERT_EQ(tvxsim_load(TVXSIM_SCENARIOS "/default.json"), 0) << tvxsim_last_error();
    ASSERT_EQ(LoadRuntimeLibraries(), 0);
    ASSERT_NE(runtimeLibraryHandle(TVX_SLOT_HBAAPI), nullptr);
    ASSERT_NE(runtimeLibraryHandle(TVX_SLOT_LRMAPI), nullptr);
  }
  void TearDown() override {
    data.freeAllData();
    EXPECT_EQ(tvxsim_open_handles(), 0U);
    UnloadRuntimeLibraries();
  }
  void fault(const char* json) { ASSERT_EQ(tvxsim_add_fault(json), 0) << tvxsim_last_error(); }
  std::vector<std::string> ports() {
    data.buildAdapterData();
    std::vector<std::string> names;
    for (const Port* port : data.m_Ports) names.push_back(port->m_Name);
    return names;
  }

  Data data;
};

constexpr const char* PORTS[] = {"10000254560C4110", "10000254560C4111", "10000254560A7E20",
                                 "10000254560A7E21"};

TEST_F(Simulated_Host, HasFourServedPorts) {
  EXPECT_THAT(ports(), testing::ElementsAreArray(PORTS));
  EXPECT_EQ(data.m_AdapterCount, data.m_Adapters.size());
  const auto& attributes =
      *dynamic_cast<FCAdapterAttributes*>(data.m_Adapters.at(0)->getAttributes());
  EXPECT_EQ(attributes.SerialNumber, "TX52100417");
  EXPECT_EQ(attributes.FirmwareVersion, "2.01a4");
  EXPECT_EQ(attributes.OptionROMVersion, "5.30a2");
  EXPECT_EQ(attributes.DeviceID, 0xE300U);
  EXPECT_EQ(attributes.BoardTemperature, 42U);
  EXPECT_EQ(attributes.ThresholdCriticalTemp, 60U);
  EXPECT_EQ(attributes.ThresholdWarningTemp, 70U);
  EXPECT_TRUE(attributes.BootCodeEnabled);
  const auto& port = *dynamic_cast<FCPortAttributes*>(data.m_Ports.at(0)->getAttributes());
  EXPECT_EQ(port.PortState, 2U);
  EXPECT_EQ(port.FabricName, "100000054D5A8001");
}

TEST_F(Simulated_Host, StaleDataAreRefreshedOnce) {
  fault(R"({"call": "HBA_GetAdapterPortAttributes", "status": 8, "first": 1})");
  EXPECT_THAT(ports(), testing::ElementsAreArray(PORTS));
  EXPECT_GE(tvxsim_calls("HBA_RefreshInformation", nullptr), 1U);
}

TEST_F(Simulated_Host, StaleAdapterDataTwiceCostThePorts) {
  fault(R"({"call": "HBA_GetAdapterAttributes", "status": 8, "first": 2})");
  const Log_Capture capture;
  EXPECT_THAT(ports(), ElementsAre(PORTS[1], PORTS[2], PORTS[3]));
  EXPECT_EQ(data.m_Adapters.size(), 4U);
  EXPECT_EQ(data.m_Adapters[0]->getNumberOfPorts(), 0U);
}

TEST_F(Simulated_Host, AFailingAttributeBlockCostsItsAdapter) {
  fault(R"({"call": "RM_GetHBAAttributes", "status": 64, "port": "10:00:02:54:56:0C:41:11"})");
  const Log_Capture capture;
  EXPECT_THAT(ports(), ElementsAre(PORTS[0], PORTS[2], PORTS[3]));
  EXPECT_TRUE(capture.has(TVX_ERR, "ERROR: RM_GetHBAAttributes call failed (64)"));
}

TEST_F(Simulated_Host, LengthsBeyondTheBlockAreHarmless) {
  for (const char* size : {"9999", "4294967295"}) {
    const std::string json =
        std::string(R"({"call": "RM_GetAttributeValue", "returned_size": )") + size + "}";
    fault(json.c_str());
    // The function type is a number: its first four bytes are there all the same.
    EXPECT_EQ(ports().size(), 4U);
    tvxsim_clear_faults();
  }
}

TEST_F(Simulated_Host, GarbageAndShortAnswersAreHarmless) {
  for (const char* json : {R"({"call": "LRM_GetHBAAttributes", "garbage": true})",
                           R"({"call": "LRM_GetPortAttributes", "garbage": true})",
                           R"({"call": "LRM_GetHBAAttributes", "write_only": 32})",
                           R"({"call": "HBA_GetAdapterAttributes", "unterminated_texts": true})"}) {
    fault(json);
    data.buildAdapterData();
    data.buildSANData();
    EXPECT_EQ(data.m_AdapterCount, data.m_Adapters.size()) << json;
    tvxsim_clear_faults();
  }
}

TEST_F(Simulated_Host, ShowsTargetsAndKeepsDeadUnitsVisible) {
  ASSERT_EQ(ports().size(), 4U);
  data.buildSANData();
  const std::size_t units = data.m_Ports[2]->getNumberOfTargets();
  ASSERT_GT(units, 0U);
  EXPECT_EQ(data.m_Ports[2]->getTarget(0)->vendor.substr(0, 4), "ACME");
  fault(R"({"call": "HBA_SendScsiInquiry", "status": 9, "page": "standard"})");
  data.buildSANData();
  EXPECT_EQ(data.m_Ports[2]->getNumberOfTargets(), units);
  EXPECT_EQ(data.m_Ports[2]->getTarget(0)->vendor, "Unknown");
}

TEST_F(Simulated_Host, AUnitThatIsBusyAtFirstIsAskedAgain) {
  ASSERT_EQ(ports().size(), 4U);
  data.buildSANData();
  const std::uint64_t blocks = data.m_Ports[0]->getTarget(0)->blockCount;
  const std::string serial = data.m_Ports[0]->getTarget(0)->serialNumber;
  ASSERT_GT(blocks, 0U);
  fault(R"({"call": "HBA_SendScsiInquiry", "page": "0x80", "status": 9, "first": 2})");
  fault(R"({"call": "HBA_SendReadCapacity", "status": 9, "first": 2})");
  data.buildSANData();
  EXPECT_EQ(data.m_Ports[0]->getTarget(0)->serialNumber, serial);
  EXPECT_EQ(data.m_Ports[0]->getTarget(0)->blockCount, blocks);
  tvxsim_clear_faults();
  fault(R"({"call": "HBA_SendReadCapacity", "status": 9, "first": 3})");
  data.buildSANData();
  EXPECT_EQ(data.m_Ports[0]->getTarget(0)->blockCount, 0U) << "not a fourth time";
  EXPECT_EQ(data.m_Ports[0]->getTarget(1)->blockCount, blocks);
}

TEST_F(Simulated_Host, MovesItsStatistics) {
  ASSERT_EQ(ports().size(), 4U);
  const auto* read = dynamic_cast<FCPortStatistics*>(data.m_Ports[0]->refreshStatistics());
  EXPECT_NE(read->counter(0x406), FCPortStatistics::NOT_SUPPLIED);
  fault(R"({"call": "LRM_GetPortStatistics", "status": 3})");
  EXPECT_THROW(data.m_Ports[0]->refreshStatistics(), std::exception);
  EXPECT_EQ(data.m_Ports[0]->m_pStatistics, read);
}

TEST_F(Simulated_Host, AnswersTheWrapper) {
  HBA_WWN wwpn{};
  ASSERT_EQ(TVX_MethodWrapper::deviceIdToWWN(&wwpn, PORTS[0]), 0);
  EXPECT_EQ(TVX_MethodWrapper::Validatewwpn(&wwpn), 0);
  const HBA_WWN other = {{9}};
  EXPECT_EQ(TVX_MethodWrapper::Validatewwpn(&other), 1);
  char version[64] = {};
  EXPECT_EQ(TVX_MethodWrapper::GetMILILibVersion(version), 0);
  EXPECT_STRNE(version, "");
}

TEST_F(Simulated_Host, CanBeReloadedWithTheLibraries) {
  for (int round = 0; round < 3; ++round) {
    EXPECT_EQ(ports().size(), 4U);
    data.freeAllData();
    UnloadRuntimeLibraries();
    ASSERT_EQ(LoadRuntimeLibraries(), 0);
  }
}

}  // namespace
}  // namespace cimrt
