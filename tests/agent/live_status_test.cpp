// What moves between two refreshes: counters and link status, read at most once in ten seconds.
#include "Instance_Checks.h"
#include "Map_Test.h"
#include "agent/FCPortTables.h"
#include "agent/LiveStatus.h"
#include "tvxsim/tvxsim.h"

namespace cimrt::test {
namespace {

constexpr std::uint64_t SECOND = 1'000'000;
constexpr const char* FIRST = "1000000000000001";
constexpr const char* SECOND_PORT = "1000000000000002";
constexpr const char* THIRD = "1000000000000003";
constexpr const char* ACTIVE_EXCEPTION =
    "Exception in Active CIM Provider Enumeration - do nothing";

/// Three single-port cards; `statistics` and `link` are members of the first port.
std::string threePorts(const std::string& first) {
  return R"({"cards": [
    {"serial_number": "A", "ports": [{"wwpn": "1000000000000001", )" +
         first + R"(}]},
    {"serial_number": "B", "adapter_name": "Torvex-second", "ports": [{"wwpn": "1000000000000002"}]},
    {"serial_number": "C", "ports": [{"wwpn": "1000000000000003"}]}]})";
}

class Live_Status : public Adapter_Maps {
 protected:
  ProviderAgent& three(const std::string& first = R"("statistics": {"crc_errors": [1, 2, 3, 4]})") {
    ProviderAgent& agent = build(threePorts(first));
    log.clear();
    tvxsim_forget_calls();
    return agent;
  }
  static void readStatistics(ProviderAgent& agent, Delivered& to) {
    agent.enumActiveInstances(agent.m_TVXHBA_FCPortStatistics_map, to.handler(), GetFCPortStats);
  }
  static void readPorts(ProviderAgent& agent, Delivered& to) {
    agent.enumActiveInstances(agent.m_TVXHBA_FCPort_map, to.handler(), UpdateFCPortStatus);
  }
  static std::int64_t crcErrors(const Delivered& from, std::size_t i) {
    return numberOf(from.at<TVXHBA_FCPortStatistics>(i)->CRCErrors);
  }
};

// --- Counters

TEST_F(Live_Status, EveryCounterHasItsProperty) {
  std::string counters;
  for (const char* id : {"0x402", "0x403", "0x404", "0x405", "0x406", "0x407", "0x408", "0x409",
                         "0x40C", "0x40D", "0x40E", "0x40F", "0x410", "0x411", "0x412", "0x413",
                         "0x414", "0x415", "0x416", "0x417", "0x418", "0x421", "0x422", "0x423"})
    counters += std::string(counters.empty() ? "" : ", ") + "\"" + id +
                "\": " + std::to_string(std::stoul(id, nullptr, 16));
  ProviderAgent& agent = three(R"("statistics": {"0x401": 7, )" + counters + "}");
  Delivered got;
  readStatistics(agent, got);
  ASSERT_EQ(got.size(), 3u);
  const auto& entry = *got.at<TVXHBA_FCPortStatistics>(0);
  const struct {
    const Property<std::uint64_t>& property;
    std::int64_t expected;
  } rows[] = {
      {entry.BytesTransmitted, 0x408 * 4},
      {entry.BytesReceived, 0x409 * 4},
      {entry.PacketsTransmitted, 0x406},
      {entry.PacketsReceived, 0x407},
      {entry.LIPCount, 0x40C},
      {entry.NOSCount, 0x40D},
      {entry.ErrorFrames, 0x40E},
      {entry.DumpedFrames, 0x40F},
      {entry.LinkFailures, 0x410},
      {entry.LossOfSyncCounter, 0x411},
      {entry.LossOfSignalCounter, 0x412},
      {entry.PrimitiveSeqProtocolErrCount, 0x413},
      {entry.InvalidTransmissionWords, 0x414},
      {entry.CRCErrors, 0x415},
      {entry.TxSequences, 0x404},
      {entry.RxSequences, 0x405},
      {entry.ExCountOrig, 0x402},
      {entry.ExCountResp, 0x403},
      {entry.LinkTransitions, 0x416},
      {entry.ActiveRPIs, 0x417},
      {entry.ActiveXRIs, 0x418},
      {entry.PrimitiveSeqTimesouts, 0x421},
      {entry.ElasticBufOverruns, 0x422},
      {entry.ArbitrationTimeouts, 0x423},
      {entry.FramesTooShort, -1},
      {entry.RXClass1Frames, -1},
      {entry.PacketsReceived, 0x407},
  };
  for (std::size_t i = 0; i < std::size(rows); i++)
    EXPECT_EQ(numberOf(rows[i].property), rows[i].expected) << "row " << i;
  EXPECT_FALSE(entry.StatisticTime.is_null());
  EXPECT_EQ(textOf(entry.InstanceID), std::string("TVX FC HBA:HBA Statistics:") + FIRST);
}

TEST_F(Live_Status, CountersAreUnsetUntilTheyAreFirstRead) {
  ProviderAgent& agent = three();
  const TVXHBA_FCPortStatistics& entry = *agent.m_TVXHBA_FCPortStatistics_map[0];
  EXPECT_TRUE(entry.BytesTransmitted.is_null());
  EXPECT_TRUE(entry.StatisticTime.is_null());
  EXPECT_EQ(tvxsim_calls("LRM_GetPortStatistics", nullptr), 0u);
}

TEST_F(Live_Status, MissingCountersShowAsTheyAreExceptForTheTwoThatKeepTheLastGoodValue) {
  ProviderAgent& agent = three(R"("statistics": {"0x40D": [5, 18446744073709551615, 6],
      "0x40F": null, "0x408": "unsupported", "0x415": null, "0x406": 4294967295})");
  for (const std::int64_t nosCount : {5, 5, 6}) {
    Delivered got;
    readStatistics(agent, got);
    const auto& entry = *got.at<TVXHBA_FCPortStatistics>(0);
    EXPECT_EQ(numberOf(entry.NOSCount), nosCount);
    EXPECT_EQ(numberOf(entry.DumpedFrames), 0);
    EXPECT_EQ(numberOf(entry.BytesTransmitted), 4 * 4294967295);
    EXPECT_EQ(numberOf(entry.CRCErrors), 4294967295);
    EXPECT_EQ(numberOf(entry.PacketsTransmitted), 4294967295);
    turnClock(10 * SECOND);
  }
}

TEST_F(Live_Status, SmallestMissingValueOfAGuardedCounterIsTheSignOfNoCounter) {
  ProviderAgent& agent = three(R"("statistics": {"0x40D": [4294967294, 4294967295, 4294967296]})");
  for (int i = 0; i < 3; i++) {
    Delivered got;
    readStatistics(agent, got);
    EXPECT_EQ(numberOf(got.at<TVXHBA_FCPortStatistics>(0)->NOSCount), 4294967294);
    turnClock(10 * SECOND);
  }
}

TEST_F(Live_Status, CountersAreReadOnceInTenSeconds) {
  ProviderAgent& agent = three();
  Delivered first;
  readStatistics(agent, first);
  turnClock(10 * SECOND - 1);
  Delivered second;
  readStatistics(agent, second);
  for (const char* port : {FIRST, SECOND_PORT, THIRD})
    EXPECT_EQ(tvxsim_calls("LRM_GetPortStatistics", port), 1u) << port;
  EXPECT_EQ(crcErrors(first, 0), 1);
  EXPECT_EQ(crcErrors(second, 0), 1);
  EXPECT_TRUE(first.at<TVXHBA_FCPortStatistics>(0)->StatisticTime.value ==
              second.at<TVXHBA_FCPortStatistics>(0)->StatisticTime.value);
  EXPECT_EQ(log.count("PERF: GetFCPortStats: Entry"), 2u);
  EXPECT_EQ(log.count("GetFCPortStats(): Update"), 1u);
  EXPECT_EQ(log.count("GetFCPortStats() :Refresh Not yet required"), 1u);
  EXPECT_EQ(log.count("PERF: GetFCPortStats: cleanExit"), 3u);
  for (const char* text :
       {"PERF: GetFCPortStats: Entry", "GetFCPortStats(): Update",
        "GetFCPortStats() :Refresh Not yet required", "PERF: GetFCPortStats: cleanExit"})
    EXPECT_EQ(log.level(text), TVX_DBG) << text;
  turnClock(1);
  Delivered third;
  readStatistics(agent, third);
  EXPECT_EQ(crcErrors(third, 0), 2);
  EXPECT_EQ(tvxsim_calls("LRM_GetPortStatistics", FIRST), 2u);
  EXPECT_EQ(third.at<TVXHBA_FCPortStatistics>(0)->StatisticTime.value.usec() -
                first.at<TVXHBA_FCPortStatistics>(0)->StatisticTime.value.usec(),
            10 * SECOND);
}

TEST_F(Live_Status, FailedReadEmptiesThatAnswerAndServesTheLastGoodValuesNext) {
  ProviderAgent& agent = three(R"("statistics": {"crc_errors": [1, 2, 3]})");
  Delivered good;
  readStatistics(agent, good);
  turnClock(10 * SECOND);
  addFault(R"({"call": "LRM_GetPortStatistics", "port": "1000000000000001", "status": 148})");
  Delivered failed;
  readStatistics(agent, failed);
  EXPECT_EQ(failed.size(), 0u);
  EXPECT_EQ(log.level("ERROR: RM_GetPortStatistics call failed (148)"), TVX_ERR);
  EXPECT_EQ(log.level("FC Port statistics error occurred,retain the old statistics"), TVX_ERR);
  EXPECT_EQ(log.level(ACTIVE_EXCEPTION), TVX_CRIT);
  tvxsim_forget_calls();
  turnClock(10 * SECOND - 1);
  Delivered next;
  readStatistics(agent, next);
  ASSERT_EQ(next.size(), 3u);
  EXPECT_EQ(crcErrors(next, 0), 1);
  EXPECT_EQ(tvxsim_calls("LRM_GetPortStatistics", nullptr), 0u);
  tvxsim_clear_faults();
  turnClock(1);
  Delivered again;
  readStatistics(agent, again);
  EXPECT_EQ(crcErrors(again, 0), 2);
}

TEST_F(Live_Status, PortsAfterTheFailingOneKeepTheirOldValuesAndThoseBeforeItHaveNewOnes) {
  ProviderAgent& agent = build(R"({"cards": [
    {"serial_number": "A", "ports": [{"wwpn": "1000000000000001", "statistics": {"0x415": [1, 2]}}]},
    {"serial_number": "B", "ports": [{"wwpn": "1000000000000002", "statistics": {"0x415": [1, 2]}}]},
    {"serial_number": "C", "ports": [{"wwpn": "1000000000000003", "statistics": {"0x415": [1, 2]}}]}
    ]})");
  Delivered good;
  readStatistics(agent, good);
  turnClock(10 * SECOND);
  addFault(R"({"call": "LRM_GetPortStatistics", "port": "1000000000000002", "status": 1})");
  Delivered failed;
  readStatistics(agent, failed);
  EXPECT_EQ(failed.size(), 0u);
  Delivered next;
  readStatistics(agent, next);
  ASSERT_EQ(next.size(), 3u);
  EXPECT_EQ(crcErrors(next, 0), 2);
  EXPECT_EQ(crcErrors(next, 1), 1);
  EXPECT_EQ(crcErrors(next, 2), 1);
  EXPECT_TRUE(next.at<TVXHBA_FCPortStatistics>(2)->StatisticTime.value ==
              good.at<TVXHBA_FCPortStatistics>(2)->StatisticTime.value);
}

TEST_F(Live_Status, PortWithoutAStatisticsInstanceIsNotRead) {
  ProviderAgent& agent = three();
  agent.m_TVXHBA_FCPortStatistics_map.delete_instance(agent.m_TVXHBA_FCPortStatistics_map[1]);
  Delivered got;
  readStatistics(agent, got);
  EXPECT_EQ(got.size(), 2u);
  EXPECT_EQ(tvxsim_calls("LRM_GetPortStatistics", SECOND_PORT), 0u);
  EXPECT_EQ(tvxsim_calls("LRM_GetPortStatistics", THIRD), 1u);
}

TEST_F(Live_Status, AdapterOfAnotherKindIsSkipped) {
  ProviderAgent& agent = three();
  Adapter& adapter = *agent.m_pData->m_Adapters.at(0);
  adapter.m_Type = 2;
  Delivered got;
  readStatistics(agent, got);
  EXPECT_EQ(got.size(), 3u);
  EXPECT_EQ(
      log.level("Skippping Adapter [" + adapter.getName() + "] since it is not an FC Adapter"),
      TVX_DBG);
  EXPECT_EQ(tvxsim_calls("LRM_GetPortStatistics", FIRST), 0u);
  EXPECT_TRUE(got.at<TVXHBA_FCPortStatistics>(0)->CRCErrors.is_null());
  adapter.m_Type = TVX_ADAPTER_TYPE_FC;
}

TEST_F(Live_Status, ThrottleOutlivesARefreshAndTheAgent) {
  ProviderAgent& agent = three();
  Delivered first;
  readStatistics(agent, first);
  refresh(agent);
  Delivered second;
  readStatistics(agent, second);
  // A refresh makes the instances anew, and they are not due to be read.
  EXPECT_TRUE(second.at<TVXHBA_FCPortStatistics>(0)->CRCErrors.is_null());
  stopAgent();
  ProviderAgent& next = rebuild();
  Delivered third;
  readStatistics(next, third);
  EXPECT_TRUE(third.at<TVXHBA_FCPortStatistics>(0)->CRCErrors.is_null());
  EXPECT_EQ(tvxsim_calls("LRM_GetPortStatistics", FIRST), 1u);
}

// --- Link status

TEST_F(Live_Status, LinkStatusFollowsTheLinkEveryTenSeconds) {
  ProviderAgent& agent = three(R"("state": "online", "speed": "16G", "symbolic_name": "before",
      "fabric_name": "100000054D5A8001", "type": "n")");
  Delivered first;
  readPorts(agent, first);
  ASSERT_EQ(first.size(), 3u);
  EXPECT_EQ(numberOf(first.at<TVXHBA_FCPort>(0)->Speed), 16'000'000'000);
  ASSERT_EQ(tvxsim_set_link(FIRST, R"({"state": "link down", "speed": "unknown",
      "symbolic_name": "after", "fabric_name": "0000000000000000", "type": "unknown"})"),
            0)
      << tvxsim_last_error();
  turnClock(10 * SECOND - 1);
  Delivered second;
  readPorts(agent, second);
  EXPECT_EQ(numbersOf(second.at<TVXHBA_FCPort>(0)->OperationalStatus),
            std::vector<std::uint16_t>{2});
  EXPECT_EQ(textOf(second.at<TVXHBA_FCPort>(0)->ElementName), "before");
  turnClock(1);
  Delivered third;
  readPorts(agent, third);
  const auto& port = *third.at<TVXHBA_FCPort>(0);
  const Port_Status& down = portStatus(HBA_PORTSTATE_LINKDOWN);
  EXPECT_EQ(numbersOf(port.OperationalStatus), std::vector<std::uint16_t>{down.operationalStatus});
  EXPECT_EQ(textsOf(port.StatusDescriptions), std::vector<std::string>{down.description});
  EXPECT_EQ(numberOf(port.PortType), 0);
  EXPECT_EQ(textOf(port.OtherPortType), "Unknown");
  EXPECT_EQ(textOf(port.ElementName), "after");
  EXPECT_EQ(textOf(port.FabricName), "0000000000000000");
  EXPECT_EQ(numberOf(port.Speed), 0);
  EXPECT_EQ(log.count("PERF: UpdateFCPortStatus: Entry"), 3u);
  EXPECT_EQ(log.count("Checking driver TimeOut..."), 3u);
  EXPECT_EQ(log.count("PERF: update driver map"), 2u);
  for (const char* text :
       {"PERF: UpdateFCPortStatus: Entry", "Checking driver TimeOut...", "PERF: update driver map"})
    EXPECT_EQ(log.level(text), TVX_DBG) << text;
}

TEST_F(Live_Status, EveryStateOfTheLinkHasItsStatusInTheEntry) {
  ProviderAgent& agent = three(R"("state": "online")");
  const struct {
    std::uint32_t state;
    std::uint16_t status;
    const char* description;
  } rows[] = {{1, 0, "Unknown"},
              {2, 2, "OK"},
              {3, 10, "Stopped"},
              {4, 1, "Other"},
              {5, 11, "InService"},
              {6, 1, "Other"},
              {7, 6, "Error"},
              {8, 0x8008, "InService"},
              {20, 0x8014, "Operational. Need RESET"},
              {21, 0x8015, "Link down. Need RESET"},
              {22, 0x8016, "Disable"},
              {99, 0, "Unknown"}};
  const TVXHBA_FCPort& port = *agent.m_TVXHBA_FCPort_map[0];
  for (const auto& row : rows) {
    ASSERT_EQ(tvxsim_set_link(FIRST, ("{\"state\": " + std::to_string(row.state) + "}").c_str()), 0)
        << tvxsim_last_error();
    turnClock(10 * SECOND);
    Delivered got;
    readPorts(agent, got);
    EXPECT_EQ(numbersOf(port.OperationalStatus), std::vector<std::uint16_t>{row.status});
    EXPECT_EQ(textsOf(port.StatusDescriptions), std::vector<std::string>{row.description});
  }
}

TEST_F(Live_Status, AttributesThatThePortHoldsAreNotTouched) {
  ProviderAgent& agent = three(R"("state": "online")");
  const auto& held = dynamic_cast<const FCPortAttributes&>(
      *agent.m_pData->m_Adapters.at(0)->getPort(0)->getAttributes());
  ASSERT_EQ(tvxsim_set_link(FIRST, R"({"state": "offline"})"), 0);
  Delivered got;
  readPorts(agent, got);
  EXPECT_EQ(numbersOf(got.at<TVXHBA_FCPort>(0)->OperationalStatus), std::vector<std::uint16_t>{10});
  EXPECT_EQ(held.PortState, HBA_PORTSTATE_ONLINE);
}

TEST_F(Live_Status, PortThatCannotBeReadLeavesAllAsItWasAndTheAnswerEmpty) {
  ProviderAgent& agent = three(R"("state": "online")");
  ASSERT_EQ(tvxsim_set_link(FIRST, R"({"state": "offline"})"), 0);
  ASSERT_EQ(tvxsim_set_link(THIRD, R"({"state": "offline"})"), 0);
  addFault(R"({"call": "HBA_OpenAdapter", "adapter": "Torvex-second-2", "status": 1})");
  Delivered failed;
  readPorts(agent, failed);
  EXPECT_EQ(failed.size(), 0u);
  EXPECT_EQ(log.level(ACTIVE_EXCEPTION), TVX_CRIT);
  tvxsim_clear_faults();
  Delivered next;
  readPorts(agent, next);
  ASSERT_EQ(next.size(), 3u);
  EXPECT_EQ(numbersOf(next.at<TVXHBA_FCPort>(0)->OperationalStatus),
            std::vector<std::uint16_t>{10});
  EXPECT_EQ(numbersOf(next.at<TVXHBA_FCPort>(2)->OperationalStatus), std::vector<std::uint16_t>{2});
}

}  // namespace
}  // namespace cimrt::test
