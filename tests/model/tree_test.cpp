// The tree itself: access, copies and destruction.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <stdexcept>
#include <string>

#include "Fake_Host.h"
#include "model/TVX_Data.h"
#include "support/Log_Capture.h"

namespace cimrt {
namespace {

using testing::ElementsAre;
using tvx::test::Fake_Host;
using tvx::test::Log_Capture;
using tvx::test::rawBytes;

/// A part whose destructor throws, when its base allows.
template <class Part>
struct Throwing : Part {
  using Part::Part;
  ~Throwing() noexcept(false) override { throw std::runtime_error("destructor"); }
};

struct Bare_Target : Target {
  explicit Bare_Target(const char* name) { portWWN = name; }
};
struct Throwing_Target : Bare_Target {
  using Bare_Target::Bare_Target;
  ~Throwing_Target() noexcept(false) override { throw std::runtime_error("destructor"); }
};

class Tree : public testing::Test {
 protected:
  void SetUp() override {
    host.add("Torvex-A0", 2);
    data.buildAdapterData();
    capture.forget();
  }
  Adapter& adapter() { return *data.m_Adapters.at(0); }
  Port& port() { return *data.m_Ports.at(0); }

  Fake_Host host;
  Log_Capture capture;
  Data data;
};

TEST_F(Tree, TheRootAsksForTheVendorLibraries) {
  EXPECT_EQ(host.loaded, 1);
  {
    const Data other;
    EXPECT_TRUE(capture.has(TVX_DBG, "Data Pointer Constructed."));
    EXPECT_EQ(other.m_AdapterCount, 0U);
  }
  EXPECT_EQ(host.loaded, 2);
  EXPECT_THAT(capture.texts(), ElementsAre("Data Pointer Constructed.", "freeAllData: Entry",
                                           "freeAllData: cleanExit", "Data Pointer deleted."));
  EXPECT_TRUE(capture.allAt(TVX_DBG));
}

TEST_F(Tree, IndexesOutOfRangeThrow) {
  EXPECT_EQ(adapter().getPort(1), data.m_Ports[1]);
  for (const int index : {2, -1, 1000}) {
    try {
      adapter().getPort(index);
      ADD_FAILURE() << index;
    } catch (const std::out_of_range& error) {
      EXPECT_STREQ(error.what(), "vector::_M_range_check");
    }
  }
  EXPECT_EQ(port().getNumberOfTargets(), 0U);
  EXPECT_THROW(port().getTarget(0), std::exception);
  EXPECT_THROW(port().getTarget(-1), std::exception);
  port().getTargets().push_back(new Bare_Target("T"));
  EXPECT_EQ(port().getTarget(0)->portWWN, "T");
  EXPECT_THROW(port().getTarget(1), std::exception);
}

TEST_F(Tree, DestructionRunsDownTheTree) {
  port().m_Targets.push_back(new Bare_Target("T1"));
  port().m_Targets.push_back(new Bare_Target("T2"));
  data.freeAllData();
  EXPECT_THAT(
      capture.texts(),
      ElementsAre("freeAllData: Entry", "Freeing adapter: Torvex-A0", "~FCAdapter",
                  "Freeing Port: 1000000000000000", "~FCPort", "~Port", "Freeing Target: T1",
                  "Freeing Target: T2", "Freeing Port: 1000000000000001", "~FCPort", "~Port",
                  "~Adapter", "freeAllData: cleanExit"));
  EXPECT_TRUE(capture.allAt(TVX_DBG));
  EXPECT_TRUE(data.m_Adapters.empty());
  EXPECT_TRUE(data.m_Ports.empty());
  EXPECT_EQ(data.m_AdapterCount, 0U);
  EXPECT_FALSE(data.m_bFCCardFound);
  capture.forget();
  data.freeAllData();
  EXPECT_THAT(capture.texts(), ElementsAre("freeAllData: Entry", "freeAllData: cleanExit"));
  data.buildAdapterData();
  EXPECT_EQ(data.m_Ports.size(), 2U);
}

TEST_F(Tree, AFailingPartDoesNotStopTheRest) {
  delete adapter().m_pStatistics;
  adapter().m_pStatistics = new Throwing<AdapterStatistics>;
  delete adapter().m_pAttributes;
  adapter().m_pAttributes = new Throwing<AdapterAttributes>;
  delete port().m_pAttributes;
  port().m_pAttributes = new Throwing<PortAttributes>;
  port().m_pStatistics = new Throwing<PortStatistics>;
  port().m_Targets.push_back(new Throwing_Target("T1"));
  port().m_Targets.push_back(new Bare_Target("T2"));
  data.freeAllData();
  EXPECT_THAT(
      capture.texts(),
      ElementsAre("freeAllData: Entry", "Freeing adapter: Torvex-A0", "~FCAdapter",
                  "Adapter attribute delete failed", "Adapter statistics delete failed",
                  "Freeing Port: 1000000000000000", "~FCPort",
                  "FC Port attribute deletion failed!!!", "FC Port statistics deletion failed!!!",
                  "~Port", "Freeing Target: T1", "Target deletion failed !!!", "Freeing Target: T2",
                  "Freeing Port: 1000000000000001", "~FCPort", "~Port", "~Adapter",
                  "freeAllData: cleanExit"));
  EXPECT_TRUE(capture.allAt(TVX_DBG)) << testing::PrintToString(capture.lines());
}

TEST_F(Tree, AFailingPortDoesNotStopTheRest) {
  adapter().m_Ports.insert(adapter().m_Ports.begin(), new Throwing<FCPort>(&adapter(), 0));
  capture.forget();
  data.freeAllData();
  EXPECT_EQ(capture.count(TVX_DBG, "Error in port freeing"), 1U);
  EXPECT_EQ(capture.count(TVX_DBG, "~FCPort"), 3U);
}

TEST_F(Tree, AFailingAdapterDoesNotStopTheRest) {
  data.m_Adapters.insert(data.m_Adapters.begin(), new Throwing<FCAdapter>("Torvex-A0", 7));
  capture.forget();
  data.freeAllData();
  EXPECT_EQ(capture.count(TVX_DBG, "Error in freeAllData -- do nothing"), 1U);
  EXPECT_EQ(capture.count(TVX_DBG, "~FCAdapter"), 2U);
  EXPECT_TRUE(data.m_Adapters.empty());
  EXPECT_EQ(capture.lines().back().text, "freeAllData: cleanExit");
}

/// The least that makes an adapter concrete.
struct Plain_Adapter : Adapter {
  using Adapter::Adapter;
  const std::string& getName() const override { return m_Name; }
  const std::int32_t& getNumber() const override { return m_Number; }
  const std::uint32_t& getFunctionType() const override { return m_FunctionType; }
  AdapterAttributes* getAttributes() override { return m_pAttributes; }
  AdapterStatistics* getStatistics() override { return m_pStatistics; }
  std::size_t getNumberOfPorts() override { return m_Ports.size(); }
  std::vector<Port*>& getPorts() override { return m_Ports; }
  Port* getPort(int) override { return nullptr; }
  void rescanTargets() override { throw std::runtime_error("rescan"); }
};

TEST_F(Tree, ADefaultAdapterHasNoNumberAndNoType) {
  const Plain_Adapter plain;
  EXPECT_EQ(plain.getName(), "");
  EXPECT_EQ(plain.getNumber(), -1);
  EXPECT_EQ(plain.m_Type, 0);
  EXPECT_EQ(plain.getFunctionType(), 0U);
}

TEST_F(Tree, ACopySharesAttributesAndPorts) {
  Plain_Adapter original("name", 3, 9);
  original.m_pAttributes = adapter().m_pAttributes;
  original.m_pStatistics = adapter().m_pStatistics;
  original.m_Ports = adapter().m_Ports;
  original.m_FunctionType = 5;
  const Plain_Adapter copy(original);
  EXPECT_EQ(copy.m_Name, "name");
  EXPECT_EQ(copy.m_Number, 3);
  EXPECT_EQ(copy.m_Type, 1);
  EXPECT_EQ(copy.m_pAttributes, original.m_pAttributes);
  EXPECT_EQ(copy.m_pStatistics, nullptr);
  EXPECT_EQ(copy.m_Ports, original.m_Ports);
}

TEST_F(Tree, AFailingRescanOfAnAdapterIsPassedOver) {
  data.m_Adapters.insert(data.m_Adapters.begin(), new Plain_Adapter("plain", 9, 2));
  host.libraries.remove("HBA_GetFcpTargetMapping");
  capture.forget();
  data.buildSANData();
  EXPECT_EQ(capture.position("buildSANData"), 0U);
  EXPECT_TRUE(capture.has(TVX_DBG, "buildSANData"));
  EXPECT_TRUE(capture.has(TVX_DBG, "Target Scan from adapter: plain"));
  EXPECT_TRUE(
      capture.has(TVX_ERR, "Issue with Target Rescan with Adapter- moving to the next adapter"));
  EXPECT_TRUE(capture.has(TVX_DBG, "Target Scan from adapter: Torvex-A0"));
}

// ---- Statistics ----

TEST_F(Tree, StatisticsAreReadByNumber) {
  EXPECT_EQ(port().m_pStatistics, nullptr);
  auto& statistics = host.adapters[0].ports[0].statistics;
  statistics[0x401] = rawBytes(std::uint64_t{1});
  statistics[0x408] = rawBytes(std::uint64_t{0x1'0000'0008});
  statistics[0x40D] = rawBytes(~std::uint64_t{0});
  statistics[0x423] = rawBytes(std::uint64_t{9});
  auto* const read = dynamic_cast<FCPortStatistics*>(port().refreshStatistics());
  ASSERT_NE(read, nullptr);
  EXPECT_EQ(read, port().m_pStatistics);
  EXPECT_EQ(read->m_Counters[0], 1U);
  EXPECT_EQ(read->counter(0x408), 0x1'0000'0008U);
  EXPECT_EQ(read->counter(0x40D), 0xFFFFFFFFU);  // all ones: not supplied
  EXPECT_EQ(read->counter(0x406), 0xFFFFFFFFU);  // not there
  EXPECT_EQ(read->counter(0x423), 9U);
  EXPECT_EQ(read->counter(0x40A), 0xFFFFFFFFU);  // no such counter
  EXPECT_EQ(read->counter(0), 0xFFFFFFFFU);
}

TEST_F(Tree, ThereAreTwentyFiveCounters) {
  EXPECT_EQ(FCPortStatistics::COUNT, 25U);
  EXPECT_EQ(FCPortStatistics::IDENTIFIERS.back(), 0U);
  EXPECT_EQ(FCPortStatistics::IDENTIFIERS[24], 0x423U);
  EXPECT_TRUE(std::is_sorted(FCPortStatistics::IDENTIFIERS.begin(),
                             FCPortStatistics::IDENTIFIERS.end() - 1));
}

TEST_F(Tree, AFailedReadRetainsTheOldStatistics) {
  host.adapters[0].ports[0].statistics[0x406] = rawBytes(std::uint64_t{5});
  const PortStatistics* old = port().refreshStatistics();
  host.adapters[0].ports[0].statisticsStatus = 4;
  EXPECT_THROW(port().refreshStatistics(), std::exception);
  EXPECT_TRUE(capture.has(TVX_ERR, "ERROR: RM_GetPortStatistics call failed (4)"));
  EXPECT_TRUE(capture.has(TVX_ERR, "FC Port statistics error occurred,retain the old statistics"));
  EXPECT_EQ(port().m_pStatistics, old);
  EXPECT_EQ(dynamic_cast<FCPortStatistics*>(port().m_pStatistics)->counter(0x406), 5U);
}

TEST_F(Tree, AGoodReadReplacesTheOldStatistics) {
  auto& statistics = host.adapters[0].ports[0].statistics;
  statistics[0x406] = rawBytes(std::uint64_t{5});
  port().m_pStatistics = new Throwing<PortStatistics>;
  const PortStatistics* fresh = port().refreshStatistics();
  EXPECT_TRUE(capture.has(TVX_DBG, "FC Port statistics deletion failed!!!")) << "the old ones";
  EXPECT_EQ(port().m_pStatistics, fresh);
  statistics[0x406] = rawBytes(std::uint64_t{6});
  const auto* next = dynamic_cast<const FCPortStatistics*>(port().refreshStatistics());
  ASSERT_NE(next, nullptr);
  EXPECT_EQ(port().m_pStatistics, next);
  EXPECT_EQ(next->counter(0x406), 6U);
}

TEST_F(Tree, APortWithoutAValidNameHasNoStatistics) {
  port().m_Name = "bad";
  EXPECT_THROW(port().refreshStatistics(), std::exception);
  EXPECT_TRUE(capture.has(TVX_ERR, "INVALID WWN"));
  EXPECT_TRUE(capture.has(TVX_ERR, "TVX_MethodWrapper::string2HBAName failed"));
}

}  // namespace
}  // namespace cimrt
