// What management can read and set on a port, entry point by entry point.
#include "sim/Management.h"

namespace tvx::sim_test {
namespace {

TEST_F(Management, StatisticsFitTheBufferAndMoveWithTimeOrScript) {
  load_port(R"("statistics": {"tx_frames": {"start": 100, "per_second": 10},
                "nos_count": [1, 5, 9], "crc_errors": "unsupported", "lip_count": null})");
  Block block(rm, RM_PORT_STATISTICS_SIZE);
  const auto read = [&] {
    block.size = RM_PORT_STATISTICS_SIZE;
    ASSERT_EQ(SIM_CALL(rm, LRM_GetPortStatistics, first_port, block.data(), &block.size), 0);
  };
  read();
  EXPECT_GE(block.u64(RM_PS_TX_FRAMES), 100u);
  EXPECT_LT(block.u64(RM_PS_TX_FRAMES), 1000u);
  EXPECT_EQ(block.u64(RM_PS_NOS_COUNT), 1u);
  EXPECT_EQ(block.u64(RM_PS_CRC_ERRORS), UINT64_MAX);
  EXPECT_FALSE(block.has(RM_PS_LIP_COUNT));
  const std::uint64_t before = block.u64(RM_PS_TX_FRAMES);
  tvxsim_advance(60);
  read();
  EXPECT_GE(block.u64(RM_PS_TX_FRAMES), before + 600);
  EXPECT_EQ(block.u64(RM_PS_NOS_COUNT), 5u);
  read();
  read();
  EXPECT_EQ(block.u64(RM_PS_NOS_COUNT), 9u);
}

TEST_F(Management, HeldClockMovesCountersOnlyWhenItIsPutForward) {
  load_port(R"("statistics": {"tx_frames": {"start": 100, "per_second": 10}})");
  tvxsim_hold_clock(1);
  Block block(rm, RM_PORT_STATISTICS_SIZE);
  const auto frames = [&] {
    block.size = RM_PORT_STATISTICS_SIZE;
    EXPECT_EQ(SIM_CALL(rm, LRM_GetPortStatistics, first_port, block.data(), &block.size), 0);
    return block.u64(RM_PS_TX_FRAMES);
  };
  EXPECT_EQ(frames(), 100u);
  tvxsim_advance(3);
  EXPECT_EQ(frames(), 130u);
  EXPECT_EQ(frames(), 130u);
  tvxsim_hold_clock(0);
  EXPECT_GE(frames(), 130u);
}

TEST_F(Management, ShippedScenarioHasAllThatMovesIsMissingOrFails) {
  load("live");
  tvxsim_hold_clock(1);
  const HBA_WWN moving = wwn(0x10000254560C5001ULL);
  const HBA_WWN failing = wwn(0x10000254560C5002ULL);
  const HBA_WWN older = wwn(0x10000254560A8001ULL);
  const HBA_WWN target = wwn(0x50060E801049CF51ULL);
  Block block(rm, RM_PORT_STATISTICS_SIZE);
  const auto read = [&](const HBA_WWN& port) {
    block.size = RM_PORT_STATISTICS_SIZE;
    return SIM_CALL(rm, LRM_GetPortStatistics, port, block.data(), &block.size);
  };
  std::uint64_t words = 1000000;
  for (const std::uint64_t errors : {0, 1, 1, 5, 5}) {
    ASSERT_EQ(read(moving), 0);
    EXPECT_EQ(block.u64(RM_PS_CRC_ERRORS), errors);
    EXPECT_EQ(block.u64(RM_PS_TX_WORDS), words);
    EXPECT_EQ(block.u64(RM_PS_NOS_COUNT), UINT64_MAX);
    EXPECT_FALSE(block.has(RM_PS_DUMPED_FRAMES));
    tvxsim_advance(10);
    words += 250000000;
  }
  for (const RM_STATUS status : {0, 0, 148, 0}) {
    EXPECT_EQ(read(failing), status);
    EXPECT_EQ(read(older), 0);
  }
  std::vector<RM_DriverParam> params(52);
  std::uint32_t count = 52;
  EXPECT_EQ(SIM_CALL(rm, LRM_GetDriverParams, older, params.data(), &count), RM_ERROR_MORE_DATA);
  EXPECT_EQ(count, 60u);
  for (const std::uint32_t option : {0u, 1u}) {
    RM_OASLunList list{};
    list.count = 0;
    EXPECT_EQ(SIM_CALL(rm, LRM_GetOASLunList, moving, moving, target, option, &list),
              RM_ERROR_MORE_DATA);
    EXPECT_EQ(list.count, 2u);
    EXPECT_EQ(SIM_CALL(rm, LRM_GetOASLunList, older, older, target, option, &list),
              RM_ERROR_NOT_SUPPORTED);
  }
}

TEST_F(Management, AllCountersOfTheInterfaceAreThere) {
  Block block(rm, RM_PORT_STATISTICS_SIZE);
  ASSERT_EQ(SIM_CALL(rm, LRM_GetPortStatistics, first_port, block.data(), &block.size), 0);
  for (const std::uint32_t id :
       {0x401, 0x402, 0x403, 0x404, 0x405, 0x406, 0x407, 0x408, 0x409, 0x40C, 0x40D, 0x40E, 0x40F,
        0x410, 0x411, 0x412, 0x413, 0x414, 0x415, 0x416, 0x417, 0x418, 0x421, 0x422, 0x423}) {
    EXPECT_TRUE(block.has(id)) << std::hex << id;
  }
}

TEST_F(Management, DriverParametersAreListedWithinTheRoom) {
  std::vector<RM_DriverParam> params(64);
  std::uint32_t count = 64;
  ASSERT_EQ(SIM_CALL(rm, LRM_GetDriverParams, first_port, params.data(), &count), 0);
  ASSERT_EQ(count, 14u);
  EXPECT_STREQ(params[1].name, "unit_queue_depth");
  EXPECT_EQ(params[1].low, 1u);
  EXPECT_EQ(params[1].high, 512u);
  EXPECT_EQ(params[1].def, 30u);
  EXPECT_EQ(params[1].dynamic, 1u);
  EXPECT_STREQ(params[1].help, "Outstanding commands for each logical unit");
  count = 2;
  params[2].name[0] = 'Z';
  EXPECT_EQ(SIM_CALL(rm, LRM_GetDriverParams, first_port, params.data(), &count),
            RM_ERROR_MORE_DATA);
  EXPECT_EQ(count, 14u);
  EXPECT_EQ(params[2].name[0], 'Z');
}

TEST_F(Management, ParametersAreSetForOnePortOrForAll) {
  std::vector<RM_DriverParam> params(64);
  std::uint32_t count = 64;
  EXPECT_EQ(SIM_CALL(rm, LRM_SetDriverParam, first_port, "unit_queue_depth=64", 1u), 0);
  SIM_CALL(rm, LRM_GetDriverParams, first_port, params.data(), &count);
  EXPECT_EQ(params[1].current, 64u);
  SIM_CALL(rm, LRM_GetDriverParams, second_port, params.data(), &count);
  EXPECT_EQ(params[1].current, 30u);
  EXPECT_EQ(SIM_CALL(rm, LRM_SetDriverParam, first_port, "unit_queue_depth=0x20", 3u), 0);
  SIM_CALL(rm, LRM_GetDriverParamsGlobal, second_port, params.data(), &count);
  EXPECT_EQ(params[1].current, 32u);
}

TEST_F(Management, WrongParametersAreRefused) {
  for (const char* text : {"unit_queue_depth=0", "unit_queue_depth=513", "unit_queue_depth=",
                           "unit_queue_depth", "nothing=1", "unit_queue_depth=3x"}) {
    EXPECT_NE(SIM_CALL(rm, LRM_SetDriverParam, first_port, text, 0u), 0) << text;
  }
}

TEST_F(Management, ALongParameterListComesFromTheScenario) {
  std::string items;
  for (int i = 0; i < 60; ++i) {
    items += std::string(i ? "," : "") + R"({"name": "p)" + std::to_string(i) + R"("})";
  }
  load_port("\"driver_params\": [" + items + "]");
  std::vector<RM_DriverParam> params(60);
  std::uint32_t count = 52;
  EXPECT_EQ(SIM_CALL(rm, LRM_GetDriverParams, first_port, params.data(), &count),
            RM_ERROR_MORE_DATA);
  EXPECT_EQ(count, 60u);
  EXPECT_EQ(SIM_CALL(rm, LRM_GetDriverParams, first_port, params.data(), &count), 0);
  EXPECT_STREQ(params[59].name, "p59");
}

TEST_F(Management, PciRegistersFollowTheFamily) {
  load_port(R"("pci": {"family": "vestra", "words": ["0xAABBCCDD", 2]})");
  RM_PCIRegisters registers{};
  std::uint32_t size = sizeof registers;
  ASSERT_EQ(SIM_CALL(rm, LRM_DiagReadPCIRegistersV2, first_port, &registers, &size), 0);
  EXPECT_EQ(size, sizeof registers);
  EXPECT_EQ(registers.header.pciType, RM_PCI_VESTRA + 0u);
  EXPECT_EQ(registers.header.deviceId, 0xE300u);
  EXPECT_EQ(registers.header.baseClass, 0x0Cu);
  EXPECT_EQ(registers.family.pcix.featureEnable, 0xAABBCCDDu);
  EXPECT_EQ(registers.family.pcix.pcixStatus, 0x50000002u);
  size = 8;
  EXPECT_EQ(SIM_CALL(rm, LRM_DiagReadPCIRegistersV2, first_port, &registers, &size),
            RM_ERROR_MORE_DATA);
}

std::vector<std::pair<std::string, std::string>> walk(const Library& rm, const void* start) {
  std::vector<std::pair<std::string, std::string>> entries;
  char keyword[4];
  char value[256];
  const void* cursor = start;
  while ((cursor = SIM_CALL(rm, RM_GetNextVpdEntry, cursor, keyword, 4u, value, 256u)) != nullptr) {
    entries.emplace_back(keyword, value);
  }
  return entries;
}

TEST_F(Management, VitalProductDataIsWalkedEntryByEntry) {
  std::vector<std::uint8_t> buffer(RM_VPD_SIZE);
  std::uint32_t size = RM_VPD_SIZE;
  ASSERT_EQ(SIM_CALL(rm, LRM_GetVPD, first_port, buffer.data(), &size), 0);
  const auto entries = walk(rm, buffer.data());
  ASSERT_EQ(entries.size(), 11u);
  EXPECT_EQ(entries[0].first, "\x82\x82");
  EXPECT_EQ(entries[0].second, "Torvex TVX16002 2-Port 16Gb PCIe Fibre Channel Adapter");
  EXPECT_EQ(entries[2], (std::pair<std::string, std::string>("SN", "TX52100417")));
  buffer.assign(RM_VPD_V2_SIZE, 0);
  size = RM_VPD_V2_SIZE;
  ASSERT_EQ(SIM_CALL(rm, LRM_GetVPDV2, first_port, 1, buffer.data(), &size), 0);
  EXPECT_EQ(walk(rm, buffer.data()).size(), 10u);
}

TEST_F(Management, AVpdBufferWithoutEntriesEndsAtOnce) {
  const std::vector<std::uint8_t> zeros(16);
  EXPECT_TRUE(walk(rm, zeros.data()).empty());
  std::vector<std::uint8_t> buffer(8);
  std::uint32_t size = 8;
  EXPECT_EQ(SIM_CALL(rm, LRM_GetVPD, first_port, buffer.data(), &size), RM_ERROR_MORE_DATA);
}

TEST_F(Management, TransceiverDataHasItsFieldsInPlace) {
  load_port(R"("transceiver": {"vendor": "OPTIX", "date_code": "751231", "diagnostics": false,
                "temperature": 41.5, "wavelength": 1310})");
  std::vector<std::uint8_t> data(RM_SFF_DATA_SIZE);
  std::uint32_t size = RM_SFF_DATA_SIZE;
  ASSERT_EQ(SIM_CALL(rm, LRM_GetSffData, first_port, data.data(), &size), 0);
  EXPECT_EQ(data[584], 1);
  EXPECT_EQ(data[585], 0);
  EXPECT_EQ(data[588], 3);
  std::uint16_t wavelength = 0;
  std::memcpy(&wavelength, &data[592], sizeof wavelength);
  EXPECT_EQ(wavelength, 1310);
  float temperature = 0;
  std::memcpy(&temperature, &data[596], sizeof temperature);
  EXPECT_FLOAT_EQ(temperature, 41.5F);
  EXPECT_STREQ(reinterpret_cast<char*>(&data[620]), "OPTIX           ");
  EXPECT_STREQ(reinterpret_cast<char*>(&data[680]), "751231");
  std::uint16_t threshold = 0;
  std::memcpy(&threshold, &data[298], sizeof threshold);
  EXPECT_EQ(threshold, 0xFB00);
  load_port(R"("transceiver": {"present": false})");
  EXPECT_NE(SIM_CALL(rm, LRM_GetSffData, first_port, data.data(), &size), 0);
}

TEST_F(Management, FlashContentsCountOneMoreThanTheEntries) {
  RM_LoadList list{};
  ASSERT_EQ(SIM_CALL(rm, LRM_DiagGetLoadListParams, first_port, &list), 0);
  EXPECT_EQ(list.count, 4u);
  EXPECT_STREQ(list.entry[0].description, "Initial Load");
  EXPECT_STREQ(list.entry[2].version, "5.30a2");
  load_port(R"("flash": [{"type": "T", "version": "1.00a1", "count": 70}])");
  ASSERT_EQ(SIM_CALL(rm, LRM_DiagGetLoadListParams, first_port, &list), 0);
  EXPECT_EQ(list.count, 65u);
}

TEST_F(Management, BeaconStaysAsSet) {
  std::uint32_t state = 0;
  EXPECT_EQ(SIM_CALL(rm, LRM_DiagBeaconState, first_port, &state), 0);
  EXPECT_EQ(state, RM_BEACON_OFF + 0u);
  EXPECT_EQ(SIM_CALL(rm, LRM_DiagBeacon, first_port, 3u), 0);
  EXPECT_EQ(SIM_CALL(rm, LRM_DiagBeaconState, first_port, &state), 0);
  EXPECT_EQ(state, RM_BEACON_ON + 0u);
  EXPECT_NE(SIM_CALL(rm, LRM_DiagBeacon, first_port, 1u), 0);
  load_port(R"("beacon": "not available")");
  EXPECT_EQ(SIM_CALL(rm, LRM_DiagBeacon, first_port, 3u), RM_ERROR_DIAG_UNAVAILABLE);
}

TEST_F(Management, ADisabledPortReportsItAndBootCodeForbidsIt) {
  std::uint8_t result = 0;
  EXPECT_EQ(SIM_CALL(rm, LRM_SetPortEnabled, first_port, 0, &result), RM_ERROR_BOOT_CODE_ENABLED);
  EXPECT_EQ(SIM_CALL(rm, LRM_SetBootBiosState, first_port, 0u), 0);
  EXPECT_EQ(adapter_number(RM_HA_BOOT_CODE_ENABLED), 0u);
  EXPECT_EQ(SIM_CALL(rm, LRM_SetPortEnabled, first_port, 0, &result), 0);
  EXPECT_EQ(result, 5);
  EXPECT_EQ(port_number(RM_PA_PORT_STATE), 22u);
  EXPECT_EQ(SIM_CALL(rm, LRM_SetPortEnabled, first_port, 1, &result), 0);
  EXPECT_EQ(port_number(RM_PA_PORT_STATE), 2u);
  EXPECT_NE(SIM_CALL(rm, LRM_SetBootBiosState, first_port, 2u), 0);
}

TEST_F(Management, ForwardErrorCorrectionIsAPortAttribute) {
  std::uint32_t value = 0;
  EXPECT_EQ(SIM_CALL(rm, LRM_SetAdapterAttribute, first_port, 864u, &value, 4u), 0);
  EXPECT_EQ(port_number(RM_PA_FEC_STATE), 0u);
  EXPECT_NE(SIM_CALL(rm, LRM_SetAdapterAttribute, first_port, 865u, &value, 4u), 0);
  EXPECT_NE(SIM_CALL(rm, LRM_SetAdapterAttribute, first_port, 864u, &value, 2u), 0);
}

TEST_F(Management, FeaturesAndHostTexts) {
  load_port(R"("features": {"201": 1})");
  std::uint32_t value = 9;
  EXPECT_EQ(SIM_CALL(rm, LRM_GetHBAFeature, first_port, 201u, &value), 0);
  EXPECT_EQ(value, 1u);
  EXPECT_EQ(SIM_CALL(rm, LRM_GetHBAFeature, first_port, 7u, &value), 0);
  EXPECT_EQ(value, 0u);
  std::vector<std::uint8_t> list(512, 0xFF);
  EXPECT_EQ(SIM_CALL(rm, LRM_GetHBAFeatureList, first_port, 512u, list.data()), 0);
  EXPECT_EQ(list[201], 1);
  EXPECT_EQ(list[430], 1);
  EXPECT_EQ(list[0], 0);
  Block block(rm, RM_SERVER_ATTRIBUTES_SIZE);
  EXPECT_EQ(SIM_CALL(rm, LRM_GetServerAttributes, wwn(5), block.data(), &block.size), 0);
  EXPECT_EQ(block.text(RM_SA_OS_INFO), "Linux 6.1.0-18-amd64");
  EXPECT_EQ(SIM_CALL(rm, LRM_GetQoS, first_port, list.data()), 0);
  EXPECT_EQ(SIM_CALL(rm, LRM_SetDebugTraces, 1, 2), 0);
  EXPECT_EQ(SIM_CALL(rm, LRM_ExitLib), 0);
}

}  // namespace
}  // namespace tvx::sim_test
