// Faults of a scenario: which calls they hit, and what a caller sees.
#include <chrono>

#include "sim/Libraries.h"

namespace tvx::sim_test {
namespace {

using Faults = Simulated_Host;

TEST_F(Faults, AStatusHitsEveryCallOrTheChosenOnes) {
  std::uint32_t type = 0;
  const auto ask = [&] { return SIM_CALL(rm, LRM_GetDriverType, first_port, &type); };
  fault(R"({"call": "LRM_GetDriverType", "status": 12, "nth": 2})");
  EXPECT_EQ(ask(), 0);
  EXPECT_EQ(ask(), 12);
  EXPECT_EQ(ask(), 0);
  tvxsim_clear_faults();
  fault(R"({"call": "RM_GetDriverType", "status": 13, "from": 2})");
  EXPECT_EQ(ask(), 0);
  EXPECT_EQ(ask(), 13);
  EXPECT_EQ(ask(), 13);
  tvxsim_clear_faults();
  fault(R"({"call": "LRM_GetDriverType", "status": 14, "first": 2})");
  EXPECT_EQ(ask(), 14);
  EXPECT_EQ(ask(), 14);
  EXPECT_EQ(ask(), 0);
}

TEST_F(Faults, AFaultMayBeAboutOnePortOrOneAdapter) {
  std::uint32_t type = 0;
  fault(R"({"call": "LRM_*", "status": 9, "port": "10:00:02:54:56:0C:41:11"})");
  EXPECT_EQ(SIM_CALL(rm, LRM_GetDriverType, first_port, &type), 0);
  EXPECT_EQ(SIM_CALL(rm, LRM_GetDriverType, wwn(0x10000254560C4111ULL), &type), 9);
  fault(R"({"call": "HBA_OpenAdapter", "status": 1, "adapter": "Torvex-TVX8102-3"})");
  EXPECT_NE(open("Torvex-TVX16002-1"), 0u);
  EXPECT_EQ(open("Torvex-TVX8102-3"), 0u);
  fault(R"({"call": "HBA_GetAdapterName", "status": 2, "adapter": "Torvex-TVX8102-4"})");
  char name[256];
  EXPECT_EQ(SIM_CALL(hba, HBA_GetAdapterName, 3u, name), 2u);
  EXPECT_EQ(SIM_CALL(hba, HBA_GetAdapterName, 2u, name), 0u);
}

TEST_F(Faults, StaleDataGoesAwayAfterTheToldNumberOfCalls) {
  fault(R"({"call": "HBA_GetAdapterPortAttributes", "status": 8, "first": 1})");
  const HBA_HANDLE handle = open("Torvex-TVX16002-1");
  HBA_PORTATTRIBUTES attributes{};
  EXPECT_EQ(SIM_CALL(hba, HBA_GetAdapterPortAttributes, handle, 0u, &attributes),
            HBA_STATUS_ERROR_STALE_DATA + 0u);
  EXPECT_EQ(SIM_CALL(hba, HBA_GetAdapterPortAttributes, handle, 0u, &attributes), 0u);
}

TEST_F(Faults, ACountMayBeFalse) {
  fault(R"({"call": "HBA_GetNumberOfAdapters", "returned_size": 9})");
  EXPECT_EQ(SIM_CALL(hba, HBA_GetNumberOfAdapters), 9u);
  tvxsim_clear_faults();
  fault(R"({"call": "HBA_GetNumberOfAdapters", "status": 1})");
  EXPECT_EQ(SIM_CALL(hba, HBA_GetNumberOfAdapters), 0u);
}

TEST_F(Faults, ADelayIsWaitedOut) {
  fault(R"({"call": "RM_MiliVersion", "delay_ms": 30})");
  char text[64];
  const auto start = std::chrono::steady_clock::now();
  EXPECT_EQ(SIM_CALL(rm, RM_MiliVersion, text, 64u), 0);
  EXPECT_GE(std::chrono::steady_clock::now() - start, std::chrono::milliseconds(30));
}

TEST_F(Faults, AttributesCanBeLeftOut) {
  fault(R"({"call": "LRM_GetHBAAttributes", "omit_attributes": ["device_id", "0x227"]})");
  Block block(rm);
  ASSERT_EQ(SIM_CALL(rm, LRM_GetHBAAttributes, first_port, block.data(), &block.size), 0);
  EXPECT_FALSE(block.has(RM_HA_DEVICE_ID));
  EXPECT_FALSE(block.has(RM_HA_BOARD_TEMPERATURE));
  EXPECT_TRUE(block.has(RM_HA_MODEL_ID));
}

TEST_F(Faults, ABlockMayBeShortOrNotABlockAtAll) {
  fault(R"({"call": "LRM_GetHBAAttributes", "write_only": 32})");
  Block block(rm);
  ASSERT_EQ(SIM_CALL(rm, LRM_GetHBAAttributes, first_port, block.data(), &block.size), 0);
  EXPECT_FALSE(block.has(RM_HA_FIRMWARE_ON_FLASH));
  tvxsim_clear_faults();
  fault(R"({"call": "LRM_GetHBAAttributes", "garbage": true})");
  ASSERT_EQ(SIM_CALL(rm, LRM_GetHBAAttributes, first_port, block.data(), &block.size), 0);
  EXPECT_FALSE(block.has(RM_HA_DEVICE_ID));
}

TEST_F(Faults, ALengthMayBeOverlong) {
  Block block(rm);
  ASSERT_EQ(SIM_CALL(rm, LRM_GetHBAAttributes, first_port, block.data(), &block.size), 0);
  fault(R"({"call": "RM_GetAttributeValue", "returned_size": 9999})");
  EXPECT_EQ(block.length(RM_HA_MODEL_ID), 9999u);
}

TEST_F(Faults, AnAttributeMayBeASuccessWithoutAValue) {
  Block block(rm);
  ASSERT_EQ(SIM_CALL(rm, LRM_GetHBAAttributes, first_port, block.data(), &block.size), 0);
  fault(R"({"call": "RM_GetAttributeValue", "status": 0})");
  RM_STATUS status = 1;
  std::uint32_t length = 0;
  EXPECT_EQ(SIM_CALL(rm, RM_GetAttributeValue, block.data(), RM_HA_MODEL_ID, &length, &status),
            nullptr);
  EXPECT_EQ(status, 0);
}

TEST_F(Faults, TextsMayLackTheirEnd) {
  fault(R"({"call": "HBA_GetAdapterAttributes", "unterminated_texts": true})");
  const HBA_HANDLE handle = open("Torvex-TVX16002-1");
  HBA_ADAPTERATTRIBUTES attributes{};
  ASSERT_EQ(SIM_CALL(hba, HBA_GetAdapterAttributes, handle, &attributes), 0u);
  EXPECT_EQ(std::memchr(attributes.SerialNumber, 0, sizeof attributes.SerialNumber), nullptr);
  EXPECT_EQ(std::string(attributes.SerialNumber, 10), "TX52100417");
}

TEST_F(Faults, CallsAreCountedWholeAndByPort) {
  tvxsim_forget_calls();
  std::uint32_t type = 0;
  SIM_CALL(rm, LRM_GetDriverType, first_port, &type);
  SIM_CALL(rm, LRM_GetDriverType, wwn(0x10000254560C4111ULL), &type);
  EXPECT_EQ(tvxsim_calls("RM_GetDriverType", nullptr), 2u);
  EXPECT_EQ(tvxsim_calls("LRM_GetDriverType", "10000254560C4110"), 1u);
  EXPECT_EQ(tvxsim_calls("LRM_GetDriverType", "1000000000000000"), 0u);
}

TEST_F(Faults, TheLinkOfAPortCanChange) {
  ASSERT_EQ(tvxsim_set_link("10000254560C4110", R"({"state": "link down", "speed": "unknown"})"),
            0);
  HBA_PORTATTRIBUTES attributes{};
  ASSERT_EQ(SIM_CALL(hba, HBA_GetAdapterPortAttributes, open("Torvex-TVX16002-1"), 0u, &attributes),
            0u);
  EXPECT_EQ(attributes.PortState, HBA_PORTSTATE_LINKDOWN + 0u);
  EXPECT_EQ(attributes.PortSpeed, 0u);
  EXPECT_EQ(attributes.PortFcId, 0x010400u);
  EXPECT_EQ(tvxsim_set_link("10000254560C4110", R"({"serial_number": "x"})"), -1);
  EXPECT_EQ(tvxsim_set_link("1000000000000000", "{}"), -1);
  EXPECT_STREQ(tvxsim_last_error(), "no such port");
}

TEST_F(Faults, AMalformedFaultIsRefusedWithItsPlace) {
  EXPECT_EQ(tvxsim_add_fault(R"({"call": "LRM_InitLib", "statos": 3})"), -1);
  EXPECT_STREQ(tvxsim_last_error(), "/statos: is not a name that is known here");
  EXPECT_EQ(tvxsim_add_fault(R"({"call": "LRM_InitLib", "nth": 0})"), -1);
  EXPECT_EQ(tvxsim_add_fault(R"({"status": 3})"), -1);
  EXPECT_EQ(tvxsim_add_fault("no json"), -1);
}

}  // namespace
}  // namespace tvx::sim_test
