// The walk over the adapters and its failures.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cstring>
#include <string>

#include "Discovery_Fixture.h"

namespace cimrt {
namespace {

using tvx::test::Fake_Adapter;
using tvx::test::rawBytes;

// ---- The walk over the adapters ----

TEST_F(Discovery, FindsAdaptersAndPorts) {
  host.add("Torvex-A0", 2);
  host.add("Torvex-A1", 1);
  build();
  EXPECT_EQ(data.m_AdapterCount, 2U);
  EXPECT_TRUE(data.m_bFCCardFound);
  ASSERT_EQ(data.m_Adapters.size(), 2U);
  Adapter& second = *data.m_Adapters[1];
  EXPECT_EQ(second.getName(), "Torvex-A1");
  EXPECT_EQ(second.getNumber(), 1);
  EXPECT_EQ(second.m_Type, TVX_ADAPTER_TYPE_FC);
  EXPECT_NE(second.getStatistics(), nullptr);
  EXPECT_EQ(second.getNumberOfPorts(), 1U);
  EXPECT_EQ(&second.getPorts(), &second.m_Ports);
  ASSERT_EQ(data.m_Ports.size(), 3U);
  EXPECT_EQ(data.m_Ports[1], data.m_Adapters[0]->getPort(1));
  EXPECT_EQ(data.m_Ports[1]->m_Name, "1000000000000001");
  EXPECT_EQ(data.m_Ports[1]->m_Index, 1U);
  EXPECT_EQ(dynamic_cast<FCPort*>(data.m_Ports[2])->m_NodeName, "200000000000000A");
  EXPECT_EQ(data.m_Ports[2]->getAdapter(), &second);
  for (const char* text : {"buildAdapterData", "buildAdapterData - with hbaapi",
                           "Number of Adapters detected = 2", "FC AdapterName : [Torvex-A0]",
                           "Adapter( adapterName[Torvex-A0], adapterNumber[0], "
                           "adapterType[1] )",
                           "FCAdapterName:Torvex-A1", "Adapter Function type : 0",
                           "Port 0's WWPN: 100000000000000A", "Port's WWPN: 1000000000000001"}) {
    EXPECT_TRUE(capture.has(TVX_DBG, text)) << text;
  }
  EXPECT_EQ(capture.position("buildAdapterData"), 0U);
  EXPECT_EQ(capture.position("freeAllData: Entry"), 1U);
  EXPECT_TRUE(capture.has(TVX_DBG, "freeAllData: Entry"));
}

TEST_F(Discovery, AHealthyHostIsTracedAtTheLowestLevelOnly) {
  host.add("Torvex-A0", 1);
  {
    Data own;
    own.buildAdapterData();
  }
  for (const auto& line : capture.lines()) EXPECT_EQ(line.level, TVX_DBG) << line.text;
  EXPECT_TRUE(capture.has(TVX_DBG, "~Port"));
  EXPECT_TRUE(capture.has(TVX_DBG, "Data Pointer deleted."));
}

TEST_F(Discovery, NoAdapterIsCritical) {
  build();
  EXPECT_TRUE(capture.has(TVX_DBG, "Number of Adapters detected = 0"));
  EXPECT_TRUE(capture.has(TVX_CRIT, "HBAAPI reports that there are NO HBAs in the system."));
  expectEmpty();
}

TEST_F(Discovery, WithoutLibrariesThereIsNoAdapter) {
  host.add("Torvex-A0", 1);
  UnloadRuntimeLibraries();
  LoadRuntimeLibraries();
  host.libraries.remove("HBA_GetNumberOfAdapters");
  build();
  expectEmpty();
}

TEST_F(Discovery, AnAdapterWithoutANameIsSkipped) {
  host.add("Torvex-A0", 1).nameStatus = 6;
  host.add("Torvex-A1", 1);
  build();
  EXPECT_TRUE(capture.has(TVX_WARN, "Error hbaStatus = 6, Skipping Adapter# 0"));
  EXPECT_EQ(data.m_AdapterCount, 1U);
  ASSERT_EQ(data.m_Adapters.size(), 1U);
  EXPECT_EQ(data.m_Adapters[0]->getNumber(), 1);
}

TEST_F(Discovery, AdaptersOfTwoNamesAreDroppedSilently) {
  for (const char* name : {"Torvex-O", "Torvex-OCN11102-0", "Torvex-N", "Torvex-NX"}) {
    host.add(name, 1);
  }
  host.add("Torvex-o", 1);
  build();
  EXPECT_EQ(data.m_AdapterCount, 1U);
  ASSERT_EQ(data.m_Adapters.size(), 1U);
  EXPECT_EQ(data.m_Adapters[0]->getName(), "Torvex-o");
  for (const auto& line : capture.lines()) EXPECT_EQ(line.level, TVX_DBG) << line.text;
  EXPECT_FALSE(capture.has(TVX_DBG, "FC AdapterName : [Torvex-O]"));
}

TEST_F(Discovery, FunctionTypesOneToThreeAreNotServed) {
  for (std::uint32_t type = 0; type <= 4; ++type) {
    host.add("Torvex-A" + std::to_string(type), 1).attributes[0x22C] = rawBytes(type);
  }
  host.add("Torvex-A5", 1);  // the read fails: type 0
  build();
  ASSERT_EQ(data.m_Adapters.size(), 3U);
  EXPECT_EQ(data.m_AdapterCount, 3U);
  EXPECT_EQ(data.m_Adapters[0]->getFunctionType(), 0U);
  EXPECT_EQ(data.m_Adapters[1]->getFunctionType(), 4U);
  EXPECT_EQ(data.m_Adapters[2]->getName(), "Torvex-A5");
  EXPECT_TRUE(capture.has(TVX_DBG, "Adapter Function type : 2"));
  EXPECT_EQ(data.m_Ports.size(), 3U);
}

TEST_F(Discovery, AnAdapterThatDoesNotOpenIsSkipped) {
  host.add("Torvex-A0", 1).opens = false;
  host.add("Torvex-A1", 1);
  expectSkipped("HBA_OpenAdapter failed, skipping Adapter Torvex-A0");
  EXPECT_EQ(data.m_AdapterCount, 1U);
  EXPECT_EQ(data.m_Adapters.size(), 1U);
}

TEST_F(Discovery, AnAdapterWhosePort0FailsIsSkipped) {
  host.add("Torvex-A0", 1);
  Fake_Adapter& bad = host.add("Torvex-A1", 1);
  bad.ports[0].statuses = {3};
  expectSkipped("(portIndex = 0) failed with hbaStatus 3", 1);
  EXPECT_EQ(data.m_Adapters.size(), 1U);
  EXPECT_EQ(data.m_AdapterCount, 1U);
  EXPECT_EQ(host.open, 0);
}

TEST_F(Discovery, AnAdapterWithoutAttributeBlockIsSkipped) {
  host.add("Torvex-A0", 1).attributesStatus = 17;
  expectSkipped("ERROR: RM_GetHBAAttributes call failed (17)");
  expectEmpty();
}

TEST_F(Discovery, AnAdapterWithoutMemoryIsSkipped) {
  host.add("Torvex-A0", 1);
  tvxSetAllocator([](std::size_t) -> void* { return nullptr; });
  build();
  EXPECT_TRUE(
      capture.has(TVX_ERR, "Catch ALL error during creating adapter..., Skipping Adapter# 0"));
  expectEmpty();
}

TEST_F(Discovery, AnAdapterWithoutPortsIsKept) {
  Fake_Adapter& adapter = host.add("Torvex-A0", 1);
  adapter.snia.NumberOfPorts = 0;
  build();
  ASSERT_EQ(data.m_Adapters.size(), 1U);
  EXPECT_EQ(data.m_Adapters[0]->getNumberOfPorts(), 0U);
  EXPECT_TRUE(data.m_bFCCardFound);
}

TEST_F(Discovery, CountsThatNoMachineHasAreBounded) {
  host.add("Torvex-A0", 1).snia.NumberOfPorts = 0xFFFFFFFF;
  host.count = 0xFFFFFFFF;
  build();
  EXPECT_EQ(data.m_AdapterCount, 1U);
  ASSERT_EQ(data.m_Adapters.size(), 1U);
  EXPECT_EQ(data.m_Adapters[0]->getNumberOfPorts(), 1U);
}

TEST_F(Discovery, AnOverlongNameIsCut) {
  host.add("Torvex-A0", 1);
  host.libraries.provide(HBA_GetAdapterName, [](HBA_UINT32, char* name) {
    std::memset(name, 'n', 300);
    return HBA_STATUS{0};
  });
  build();
  EXPECT_TRUE(capture.has(TVX_DBG, "FC AdapterName : [" + std::string(255, 'n') + "]"));
}

TEST_F(Discovery, ARebuildReplacesTheTree) {
  host.add("Torvex-A0", 2);
  build();
  host.adapters.clear();
  host.add("Torvex-B0", 1);
  build();
  ASSERT_EQ(data.m_Adapters.size(), 1U);
  EXPECT_EQ(data.m_Adapters[0]->getName(), "Torvex-B0");
  EXPECT_EQ(data.m_Ports.size(), 1U);
  EXPECT_TRUE(capture.has(TVX_DBG, "Freeing adapter: Torvex-A0"));
}

}  // namespace
}  // namespace cimrt
