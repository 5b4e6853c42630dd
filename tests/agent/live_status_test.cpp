// What moves between two refreshes: counters and link status, read at most once in ten seconds.
#include <set>

#include "Instance_Checks.h"
#include "Map_Test.h"
#include "agent/FCPortTables.h"
#include "agent/LiveStatus.h"
#include "common/TVX_Clock.h"
#include "common/TVX_Memory.h"
#include "runtime/Value.h"
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
  /// Runs an update as the active form does: all that it logged.
  std::vector<Logged> linesOf(ProviderAgent& agent, Live_Update update) {
    log.clear();
    Ranked_Lock data(agent.m_DataMutex);
    update(agent);
    return log.all();
  }
  /// The texts among `of`, every one of them at `TVX_DBG`.
  static std::vector<std::string> steps(const std::vector<Logged>& lines,
                                        const std::set<std::string>& of) {
    std::vector<std::string> found;
    for (const Logged& line : lines) {
      if (!of.contains(line.text)) continue;
      EXPECT_EQ(line.level, TVX_DBG) << line.text;
      found.push_back(line.text);
    }
    return found;
  }
  /// The texts of all lines, every one of them at `TVX_DBG`.
  static std::vector<std::string> steps(const std::vector<Logged>& lines) {
    std::set<std::string> all;
    for (const Logged& line : lines) all.insert(line.text);
    return steps(lines, all);
  }
  /// Memory that takes three seconds to get.
  static void* slowMemory(std::size_t size) {
    turnClock(3 * SECOND);
    return std::calloc(1, size);
  }
};

/// Names of the properties that have a value.
std::set<std::string> valued(const Instance* instance) {
  std::set<std::string> names;
  const Meta_Class* metaClass = class_of(instance);
  for (std::uint64_t i = 0; i < metaClass->num_meta_features; i++) {
    Value value;
    if (value.get(instance, metaClass->meta_features[i]) == 0 && !value.null())
      names.insert(metaClass->meta_features[i]->name);
  }
  return names;
}

using Texts = std::vector<std::string>;

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

TEST_F(Live_Status, ReadSetsTheCountersOfTheTableWithTheirTimeAndNothingElse) {
  ProviderAgent& agent = three(R"("statistics": {"0x401": 7777777})");
  const TVXHBA_FCPortStatistics& entry = *agent.m_TVXHBA_FCPortStatistics_map[0];
  const std::set<std::string> before = valued(&entry);
  Delivered got;
  readStatistics(agent, got);
  std::set<std::string> added;
  for (const std::string& name : valued(&entry))
    if (!before.contains(name)) added.insert(name);
  EXPECT_EQ(added, (std::set<std::string>{"ActiveRPIs",
                                          "ActiveXRIs",
                                          "ArbitrationTimeouts",
                                          "BytesReceived",
                                          "BytesTransmitted",
                                          "CRCErrors",
                                          "DumpedFrames",
                                          "ElasticBufOverruns",
                                          "ErrorFrames",
                                          "ExCountOrig",
                                          "ExCountResp",
                                          "InvalidTransmissionWords",
                                          "LIPCount",
                                          "LinkFailures",
                                          "LinkTransitions",
                                          "LossOfSignalCounter",
                                          "LossOfSyncCounter",
                                          "NOSCount",
                                          "PacketsReceived",
                                          "PacketsTransmitted",
                                          "PrimitiveSeqProtocolErrCount",
                                          "PrimitiveSeqTimesouts",
                                          "RxSequences",
                                          "StatisticTime",
                                          "TxSequences"}));
  // The counter that has no property is in none of them.
  for (std::uint64_t i = 0; i < class_of(&entry)->num_meta_features; i++) {
    Value value;
    std::uint64_t number = 0;
    if (value.get(&entry, class_of(&entry)->meta_features[i]) == 0 && value.get(number) == 0) {
      EXPECT_NE(number, 7777777u) << class_of(&entry)->meta_features[i]->name;
    }
  }
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

TEST_F(Live_Status, HardwareWithoutAnyCounterShowsTheSignOfNoneInEachButTheTwo) {
  std::string none;
  for (int id = 0x401; id <= 0x423; id++)
    if (id <= 0x409 || (id >= 0x40C && id <= 0x418) || id >= 0x421)
      none += std::string(none.empty() ? "" : ", ") + "\"" + std::to_string(id) + "\": null";
  ProviderAgent& agent = three("\"statistics\": {" + none + "}");
  Delivered got;
  readStatistics(agent, got);
  const auto& entry = *got.at<TVXHBA_FCPortStatistics>(0);
  for (const auto* property : {&entry.PacketsTransmitted,
                               &entry.PacketsReceived,
                               &entry.LIPCount,
                               &entry.ErrorFrames,
                               &entry.LinkFailures,
                               &entry.LossOfSyncCounter,
                               &entry.LossOfSignalCounter,
                               &entry.PrimitiveSeqProtocolErrCount,
                               &entry.InvalidTransmissionWords,
                               &entry.CRCErrors,
                               &entry.TxSequences,
                               &entry.RxSequences,
                               &entry.ExCountOrig,
                               &entry.ExCountResp,
                               &entry.LinkTransitions,
                               &entry.ActiveRPIs,
                               &entry.ActiveXRIs,
                               &entry.PrimitiveSeqTimesouts,
                               &entry.ElasticBufOverruns,
                               &entry.ArbitrationTimeouts})
    EXPECT_EQ(numberOf(*property), 4294967295);
  EXPECT_EQ(numberOf(entry.BytesTransmitted), 17179869180);
  EXPECT_EQ(numberOf(entry.BytesReceived), 17179869180);
  EXPECT_EQ(numberOf(entry.NOSCount), 0);
  EXPECT_EQ(numberOf(entry.DumpedFrames), 0);
}

TEST_F(Live_Status, SmallestMissingValueOfAGuardedCounterIsTheSignOfNoCounter) {
  ProviderAgent& agent = three(R"("statistics": {"0x40D": [4294967294, 4294967295, 4294967296],
      "0x40F": [4294967294, 4294967295, 18446744073709551615]})");
  for (int i = 0; i < 3; i++) {
    Delivered got;
    readStatistics(agent, got);
    EXPECT_EQ(numberOf(got.at<TVXHBA_FCPortStatistics>(0)->NOSCount), 4294967294);
    EXPECT_EQ(numberOf(got.at<TVXHBA_FCPortStatistics>(0)->DumpedFrames), 4294967294);
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

TEST_F(Live_Status, ReadingCountersTellsItsSteps) {
  ProviderAgent& agent = three();
  const Texts whole = {"PERF: GetFCPortStats: Entry", "GetFCPortStats(): Update",
                       "PERF: GetFCPortStats: cleanExit", "PERF: GetFCPortStats: cleanExit",
                       "PERF: GetFCPortStats: cleanExit"};
  EXPECT_EQ(steps(linesOf(agent, GetFCPortStats), {whole.begin(), whole.end()}), whole);
  EXPECT_EQ(steps(linesOf(agent, GetFCPortStats)),
            (Texts{"PERF: GetFCPortStats: Entry", "GetFCPortStats() :Refresh Not yet required"}));
}

TEST_F(Live_Status, RunCountsFromItsBeginningAndEachPortHasTheTimeOfItsOwnRead) {
  ProviderAgent& agent = three();
  const std::uint64_t begin = tvxNow();
  tvxSetAllocator(slowMemory);  // each port takes a block
  Delivered slow;
  readStatistics(agent, slow);
  tvxSetAllocator(nullptr);
  for (std::size_t i = 0; i < 3; i++)
    EXPECT_EQ(slow.at<TVXHBA_FCPortStatistics>(i)->StatisticTime.value.usec(),
              begin + (i + 1) * 3 * SECOND);
  turnClock(SECOND - 1);
  Delivered soon;
  readStatistics(agent, soon);
  EXPECT_EQ(crcErrors(soon, 0), 1);
  turnClock(1);
  Delivered next;
  readStatistics(agent, next);
  EXPECT_EQ(crcErrors(next, 0), 2);
}

TEST_F(Live_Status, ClockThatWasSetBackCountsAsPassed) {
  ProviderAgent& agent = three();
  Delivered first;
  readStatistics(agent, first);
  turnClock(0 - SECOND);
  Delivered second;
  readStatistics(agent, second);
  EXPECT_EQ(crcErrors(second, 0), 2);
}

TEST_F(Live_Status, CountersGoToTheFirstEntryWhoseIdContainsThePort) {
  ProviderAgent& agent = three();
  auto& entries = agent.m_TVXHBA_FCPortStatistics_map;
  entries[0]->InstanceID.set((std::string("of ") + THIRD + " and " + FIRST + ".").c_str());
  entries.key_changed(0);
  Delivered got;
  readStatistics(agent, got);
  EXPECT_FALSE(entries[0]->CRCErrors.is_null());
  EXPECT_FALSE(entries[1]->CRCErrors.is_null());
  EXPECT_TRUE(entries[2]->CRCErrors.is_null()) << "the third port's counters are in the first";
  EXPECT_EQ(tvxsim_calls("LRM_GetPortStatistics", THIRD), 1u);
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

TEST_F(Live_Status, ThrottleOfTheLinkStatusOutlivesARefreshAndTheAgent) {
  ProviderAgent* agent = &three(R"("state": "online")");
  Delivered first;
  readPorts(*agent, first);
  for (int life = 0; life < 2; life++) {
    refresh(*agent);
    ASSERT_EQ(tvxsim_set_link(FIRST, R"({"state": "offline"})"), 0);
    Delivered next;
    readPorts(*agent, next);
    EXPECT_EQ(numbersOf(next.at<TVXHBA_FCPort>(0)->OperationalStatus),
              std::vector<std::uint16_t>{2});
    ASSERT_EQ(tvxsim_set_link(FIRST, R"({"state": "online"})"), 0);
    if (life > 0) break;
    stopAgent();
    agent = &rebuild();
  }
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

TEST_F(Live_Status, EveryTypeOfThePortIsInTheEntry) {
  ProviderAgent& agent = three(R"("state": "online")");
  const struct {
    std::uint32_t type;
    std::uint16_t value;
    const char* text;
  } rows[] = {{5, 10, "N"},      {1, 0, "Unknown"},       {6, 11, "NL"},
              {3, 0, "Unknown"}, {7, 16, "FL"},           {2, 1, "Other"},
              {8, 15, "F"},      {4, 0, "Unknown"},       {9, 14, "E"},
              {10, 18, "G"},     {20, 1, "Private Loop"}, {21, 1, "Point to Point"},
              {99, 0, "Unknown"}};
  const TVXHBA_FCPort& port = *agent.m_TVXHBA_FCPort_map[0];
  for (const auto& row : rows) {
    ASSERT_EQ(tvxsim_set_link(FIRST, ("{\"type\": " + std::to_string(row.type) + "}").c_str()), 0)
        << tvxsim_last_error();
    turnClock(10 * SECOND);
    Delivered got;
    readPorts(agent, got);
    EXPECT_EQ(numberOf(port.PortType), row.value) << row.type;
    EXPECT_EQ(textOf(port.OtherPortType), row.text) << row.type;
  }
}

TEST_F(Live_Status, EverySpeedIsInTheEntry) {
  ProviderAgent& agent = three(R"("state": "online")");
  const struct {
    std::uint32_t speed;
    std::int64_t bits;
  } rows[] = {{1, 1'000'000'000},
              {2, 2'000'000'000},
              {4, 10'000'000'000},
              {8, 4'000'000'000},
              {64, 0},
              {16, 8'000'000'000},
              {0, 0},
              {32, 16'000'000'000},
              {3, 0}};
  const TVXHBA_FCPort& port = *agent.m_TVXHBA_FCPort_map[0];
  for (const auto& row : rows) {
    ASSERT_EQ(tvxsim_set_link(FIRST, ("{\"speed\": " + std::to_string(row.speed) + "}").c_str()), 0)
        << tvxsim_last_error();
    turnClock(10 * SECOND);
    Delivered got;
    readPorts(agent, got);
    EXPECT_EQ(numberOf(port.Speed), row.bits) << row.speed;
  }
}

TEST_F(Live_Status, LinkStatusIsReadOnceInTenSecondsAndTellsItsSteps) {
  ProviderAgent& agent = three();
  const Texts whole = {"PERF: UpdateFCPortStatus: Entry", "Checking driver TimeOut...",
                       "PERF: update driver map"};
  EXPECT_EQ(steps(linesOf(agent, UpdateFCPortStatus), {whole.begin(), whole.end()}), whole);
  turnClock(10 * SECOND - 1);
  EXPECT_EQ(steps(linesOf(agent, UpdateFCPortStatus)),
            (Texts{"PERF: UpdateFCPortStatus: Entry", "Checking driver TimeOut...",
                   "PERF: Refresh Not yet required"}));
  for (const char* port : {FIRST, SECOND_PORT, THIRD})
    EXPECT_EQ(tvxsim_calls("LRM_GetPortAttributes", port), 1u) << port;
  EXPECT_EQ(tvxsim_calls("HBA_GetAdapterPortAttributes", nullptr), 3u);
}

TEST_F(Live_Status, LinkStatusOfAnAdapterOfAnotherKindIsLeftAsItIs) {
  ProviderAgent& agent = three(R"("state": "online")");
  Adapter& adapter = *agent.m_pData->m_Adapters.at(0);
  adapter.m_Type = 2;
  ASSERT_EQ(tvxsim_set_link(FIRST, R"({"state": "offline"})"), 0);
  ASSERT_EQ(tvxsim_set_link(THIRD, R"({"state": "offline"})"), 0);
  Delivered got;
  readPorts(agent, got);
  EXPECT_EQ(
      log.level("Skippping Adapter [" + adapter.getName() + "] since it is not an FC Adapter"),
      TVX_DBG);
  EXPECT_EQ(numbersOf(got.at<TVXHBA_FCPort>(0)->OperationalStatus), std::vector<std::uint16_t>{2});
  EXPECT_EQ(numbersOf(got.at<TVXHBA_FCPort>(2)->OperationalStatus), std::vector<std::uint16_t>{10});
  EXPECT_EQ(tvxsim_calls("LRM_GetPortAttributes", FIRST), 0u);
  adapter.m_Type = TVX_ADAPTER_TYPE_FC;
}

TEST_F(Live_Status, LinkStatusGoesToTheFirstEntryWhoseIdContainsThePort) {
  ProviderAgent& agent = three(R"("state": "online")");
  auto& ports = agent.m_TVXHBA_FCPort_map;
  ports[0]->DeviceID.set((std::string("of ") + THIRD + ".").c_str());
  ports.key_changed(0);
  for (const char* port : {FIRST, SECOND_PORT, THIRD})
    ASSERT_EQ(tvxsim_set_link(port, R"({"state": "offline"})"), 0);
  Delivered got;
  readPorts(agent, got);
  EXPECT_EQ(numbersOf(ports[0]->OperationalStatus), std::vector<std::uint16_t>{10});
  EXPECT_EQ(numbersOf(ports[1]->OperationalStatus), std::vector<std::uint16_t>{10});
  EXPECT_EQ(numbersOf(ports[2]->OperationalStatus), std::vector<std::uint16_t>{2});
  EXPECT_EQ(tvxsim_calls("LRM_GetPortAttributes", FIRST), 0u) << "no entry, no read";
  EXPECT_EQ(tvxsim_calls("LRM_GetPortAttributes", THIRD), 1u);
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
