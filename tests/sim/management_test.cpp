// What management can read and change, entry point by entry point.
#include <filesystem>
#include <fstream>

#include "sim/Libraries.h"

namespace tvx::sim_test {
namespace {

const HBA_WWN second_port = wwn(0x10000254560C4111ULL);

class Management : public Simulated_Host {
 protected:
  void load_port(const std::string& members) {
    const std::string text =
        R"({"cards": [{"model": "TVX16001", "ports": [{"wwpn": "10000254560C4110")" +
        (members.empty() ? "" : ", " + members) + "}]}]}";
    ASSERT_EQ(tvxsim_load_text(text.c_str()), 0) << tvxsim_last_error();
  }

  std::uint32_t adapter_number(std::uint32_t id) {
    Block block(rm);
    EXPECT_EQ(SIM_CALL(rm, LRM_GetHBAAttributes, first_port, block.data(), &block.size), 0);
    return block.u32(id);
  }
  std::string adapter_text(std::uint32_t id, const HBA_WWN& port = first_port) {
    Block block(rm);
    EXPECT_EQ(SIM_CALL(rm, LRM_GetHBAAttributes, port, block.data(), &block.size), 0);
    return block.text(id);
  }
  std::uint32_t port_number(std::uint32_t id) {
    Block block(rm, 2048);
    EXPECT_EQ(SIM_CALL(rm, LRM_GetPortAttributes, first_port, block.data(), &block.size), 0);
    return block.u32(id);
  }
};

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

struct Names {
  std::uint64_t wwpn = 0;
  std::uint32_t status = 99;
};

Names read_names(const Library& rm, const HBA_WWN& port, std::uint32_t type) {
  HBA_WWN wwpn_out{};
  HBA_WWN wwnn_out{};
  Names names;
  EXPECT_EQ(SIM_CALL(rm, LRM_ReadWWN, port, type, &wwpn_out, &wwnn_out, &names.status), 0);
  names.wwpn = number(wwpn_out);
  return names;
}

TEST_F(Management, AChangedNameWaitsForTheResetAndIsReadBack) {
  const HBA_WWN fresh = wwn(0x1000025456999999ULL);
  std::uint32_t status = 0;
  ASSERT_EQ(SIM_CALL(rm, LRM_ChangeWWN, first_port, fresh, wwn(0x2000025456999999ULL), 1u, &status),
            0);
  EXPECT_EQ(status, 8u);
  EXPECT_EQ(read_names(rm, first_port, 4).status, 8u);
  EXPECT_EQ(read_names(rm, first_port, 4).wwpn, 0x1000025456999999ULL);
  EXPECT_EQ(read_names(rm, first_port, 3).wwpn, number(first_port));
  ASSERT_EQ(SIM_CALL(rm, LRM_ResetHBA, first_port, 1), 0);
  EXPECT_EQ(read_names(rm, fresh, 3).wwpn, 0x1000025456999999ULL);
  EXPECT_EQ(read_names(rm, fresh, 2).wwpn, number(first_port));
  EXPECT_EQ(read_names(rm, fresh, 4).status, 9u);
  HBA_PORTATTRIBUTES attributes{};
  ASSERT_EQ(SIM_CALL(hba, HBA_GetAdapterPortAttributes, open("Torvex-TVX16002-1"), 0u, &attributes),
            0u);
  EXPECT_EQ(number(attributes.PortWWN), 0x1000025456999999ULL);
  ASSERT_EQ(SIM_CALL(rm, LRM_RestoreWWN, fresh, 0u, &status), 0);
  EXPECT_EQ(status, 8u);
  SIM_CALL(rm, LRM_ResetHBA, fresh, 1);
  ASSERT_EQ(SIM_CALL(rm, LRM_RestoreWWN, first_port, 0u, &status), 0);
  EXPECT_EQ(status, 1u);
}

TEST_F(Management, VolatileNamesTellThatTheyAreActive) {
  const HBA_WWN fresh = wwn(0x1000025456888888ULL);
  std::uint32_t status = 0;
  EXPECT_EQ(read_names(rm, first_port, 0).status, 9u);
  ASSERT_EQ(SIM_CALL(rm, LRM_ChangeWWN, first_port, fresh, fresh, 0u, &status), 0);
  EXPECT_EQ(status, 7u);
  SIM_CALL(rm, LRM_ResetHBA, first_port, 1);
  EXPECT_EQ(read_names(rm, fresh, 3).status, 3u);
  EXPECT_EQ(read_names(rm, fresh, 0).status, 1u);
  EXPECT_EQ(read_names(rm, fresh, 1).wwpn, number(first_port));
}

TEST_F(Management, NameManagementFollowsItsCapability) {
  std::uint32_t capability = 0;
  std::uint32_t status = 0;
  EXPECT_EQ(SIM_CALL(rm, LRM_GetWWNCapability, first_port, &capability), 0);
  EXPECT_EQ(capability, 0x200Cu);
  load_port(R"("wwn_management": {"capability": 4, "busy_calls": 2, "activation": "reboot"})");
  HBA_WWN out{};
  EXPECT_EQ(
      SIM_CALL(rm, LRM_ChangeWWN, first_port, wwn(0x1000025456888888ULL), wwn(1), 0u, &status),
      RM_ERROR_WWN_NOT_SUPPORTED);
  EXPECT_EQ(SIM_CALL(rm, LRM_ReadWWN, first_port, 0u, &out, &out, &status),
            RM_ERROR_WWN_NOT_SUPPORTED);
  const auto change = [&] {
    return SIM_CALL(rm, LRM_ChangeWWN, first_port, wwn(0x1000025456888888ULL),
                    wwn(0x2000025456888888ULL), 1u, &status);
  };
  EXPECT_EQ(change(), RM_ERROR_WWN_IN_PROGRESS);
  EXPECT_EQ(change(), RM_ERROR_WWN_IN_PROGRESS);
  EXPECT_EQ(change(), 0);
  EXPECT_EQ(status, 6u);
  load_port(R"("wwn_management": {"capability": 0})");
  EXPECT_EQ(SIM_CALL(rm, LRM_GetWWNCapability, first_port, &capability), RM_ERROR_WWN_UNAVAILABLE);
  EXPECT_EQ(change(), RM_ERROR_WWN_UNAVAILABLE);
}

TEST_F(Management, DumpsAreGeneratedListedKeptAndDeleted) {
  EXPECT_EQ(SIM_CALL(rm, LRM_SetDumpRetentionCount, first_port, 2u), 0);
  std::uint32_t kept = 0;
  EXPECT_EQ(SIM_CALL(rm, LRM_GetDumpRetentionCount, first_port, &kept), 0);
  EXPECT_EQ(kept, 2u);
  EXPECT_NE(SIM_CALL(rm, LRM_SetDumpRetentionCount, first_port, 21u), 0);
  for (int i = 0; i < 2; ++i) EXPECT_EQ(SIM_CALL(rm, LRM_GenerateDump, 0, first_port), 0);
  EXPECT_EQ(SIM_CALL(rm, LRM_GenerateEfdDump, first_port, 1, 0), 0);
  std::vector<std::uint64_t> memory(1 + 4 * 32);
  auto* names = reinterpret_cast<RM_DumpFileNames*>(memory.data());
  names->count = 4;
  ASSERT_EQ(SIM_CALL(rm, LRM_GetDumpFileNames, first_port, names), 0);
  ASSERT_EQ(names->count, 2u);
  const char* slots = names->name[0];
  EXPECT_STREQ(slots, "10000254560C4110_000002.dmp");
  EXPECT_STREQ(slots + 256, "10000254560C4110_000003.efd");
  names->count = 1;
  EXPECT_EQ(SIM_CALL(rm, LRM_GetDumpFileNames, first_port, names), RM_ERROR_LIST_TOO_SMALL);
  EXPECT_EQ(names->count, 2u);
  EXPECT_EQ(SIM_CALL(rm, LRM_DeleteDumpFiles, first_port), 0);
  EXPECT_EQ(SIM_CALL(rm, LRM_GetDumpFileNames, first_port, names), 0);
  EXPECT_EQ(names->count, 0u);
}

TEST_F(Management, OtherDumpsAndTheirSettings) {
  char directory[256];
  EXPECT_EQ(SIM_CALL(rm, LRM_GetDumpDirectoryA, first_port, directory, 256u), 0);
  EXPECT_STREQ(directory, "/var/opt/torvex/dump");
  EXPECT_EQ(SIM_CALL(rm, LRM_SetDumpDirectory, first_port, "/srv/dumps"), 0);
  EXPECT_EQ(SIM_CALL(rm, LRM_SetDumpDirectory, first_port, "relative"), RM_ERROR_DIRECTORY);
  EXPECT_EQ(SIM_CALL(rm, LRM_GetDumpDirectoryA, first_port, directory, 256u), 0);
  EXPECT_STREQ(directory, "/srv/dumps");
  EXPECT_EQ(SIM_CALL(rm, LRM_GenerateCoreDump, first_port, "all"), 0);
  EXPECT_EQ(SIM_CALL(rm, LRM_RetrieveFATDump, first_port), 0);
  EXPECT_EQ(SIM_CALL(rm, LRM_RetrieveFATDump2, first_port), 0);
  RM_EventLogConfig config{};
  EXPECT_EQ(SIM_CALL(rm, LRM_Get_BE_EventLogConfigDataAll, first_port, &config), 0);
  EXPECT_LE(config.count, config.capacity);
  const RM_EventLogModule module{};
  EXPECT_EQ(SIM_CALL(rm, LRM_Set_BE_EventLogConfigDataModule, first_port, &module), 0);
  EXPECT_EQ(SIM_CALL(rm, LRM_Set_BE_EventLogTraceLevel, first_port, 1u, 2u, 3u, 4u), 0);
  EXPECT_EQ(SIM_CALL(rm, LRM_Set_BE_DefaultLoggingConfig, first_port), 0);
}

TEST_F(Management, OptimizedAccessIsKeptByTargetUnitAndOption) {
  const HBA_WWN target = wwn(0x500C0FF12A001001ULL);
  for (const std::uint64_t lun : {3ull, 4ull}) {
    EXPECT_EQ(SIM_CALL(rm, LRM_SetOASLunState, first_port, first_port, target, lun, 1, 1u), 0);
  }
  std::vector<std::uint8_t> memory(4 + 2 * sizeof(RM_OASLunEntry));
  std::uint32_t count = 1;
  const auto list = [&](std::uint32_t option) {
    std::memcpy(memory.data(), &count, 4);
    const RM_STATUS status = SIM_CALL(rm, LRM_GetOASLunList, first_port, first_port, target, option,
                                      reinterpret_cast<RM_OASLunList*>(memory.data()));
    std::memcpy(&count, memory.data(), 4);
    return status;
  };
  EXPECT_EQ(list(1), RM_ERROR_MORE_DATA);
  EXPECT_EQ(count, 2u);
  EXPECT_EQ(list(1), 0);
  EXPECT_STREQ(reinterpret_cast<char*>(&memory[4 + 36]), "4");
  EXPECT_EQ(memory[4 + 36 + 8], 4);
  EXPECT_EQ(memory[4 + 36 + 17], 1);
  EXPECT_EQ(list(0), 0);
  EXPECT_EQ(count, 0u);
  EXPECT_EQ(SIM_CALL(rm, LRM_SetOASLunState, first_port, first_port, target, 3ull, 0, 1u), 0);
  count = 2;
  EXPECT_EQ(list(1), 0);
  EXPECT_EQ(count, 1u);
  load_port(R"("oas_supported": false)");
  EXPECT_EQ(list(1), 2);
}

TEST_F(Management, VirtualPortsAreListedWithTheirNames) {
  load_port(R"("vports": [{"wwpn": "1010025456000001", "name": "guest one"}, {"count": 3}])");
  std::vector<std::uint8_t> memory(4 + 4 * sizeof(RM_VPortEntry));
  auto* list = reinterpret_cast<RM_VPortList*>(memory.data());
  list->count = 1;
  EXPECT_EQ(SIM_CALL(rm, LRM_VPList, first_port, list), RM_ERROR_MORE_DATA);
  ASSERT_EQ(list->count, 4u);
  EXPECT_EQ(SIM_CALL(rm, LRM_VPList, first_port, list), 0);
  EXPECT_EQ(number(list->entry[0].wwpn), 0x1010025456000001ULL);
  RM_VPortAttributes attributes{};
  EXPECT_NE(SIM_CALL(rm, LRM_VPGetAttributes, first_port, wwn(0x1010025456000001ULL), &attributes),
            0);
  attributes.version = 3;
  EXPECT_EQ(SIM_CALL(rm, LRM_VPGetAttributes, first_port, wwn(0x1010025456000001ULL), &attributes),
            0);
  EXPECT_STREQ(attributes.name, "guest one");
  load_port(R"("vports_supported": false)");
  EXPECT_EQ(SIM_CALL(rm, LRM_VPList, first_port, list), RM_ERROR_VPORT_UNSUPPORTED);
}

TEST_F(Management, DiagnosticsRunForTheirPollsAndEndAsPlanned) {
  load_port(R"("diagnostics": {"post": {"polls": 2}, "echo": {"result": 10, "polls": 0},
                "loopback": {"endless": true}})");
  std::uint32_t id = 0;
  RM_DiagResult result{};
  ASSERT_EQ(SIM_CALL(rm, LRM_DiagRunPOST, first_port, &id), 0);
  const auto poll = [&] { return SIM_CALL(rm, LRM_DiagGetResults, first_port, id, &result); };
  EXPECT_EQ(poll(), 0);
  EXPECT_EQ(result.state, RM_DIAG_RUNNING + 0u);
  EXPECT_EQ(poll(), 0);
  EXPECT_EQ(result.state, RM_DIAG_RUNNING + 0u);
  EXPECT_EQ(poll(), 0);
  EXPECT_EQ(result.state, RM_DIAG_DONE + 0u);
  EXPECT_EQ(result.result, 0u);
  EXPECT_NE(poll(), 0);
  ASSERT_EQ(SIM_CALL(rm, LRM_DiagEchoTestV2, first_port, wwn(9), 5u, 1u, &id, 0u, "aa"), 0);
  EXPECT_EQ(poll(), 0);
  EXPECT_EQ(result.result, 10u);
  EXPECT_EQ(result.cyclesCompleted, 5u);
  EXPECT_EQ(result.errorCount, 1u);
  ASSERT_EQ(SIM_CALL(rm, LRM_DiagPciLoopBackTestV2, first_port, 1u, 0u, &id, 0u, "aa"), 0);
  EXPECT_EQ(poll(), 0);
}

TEST_F(Management, AnEndlessDiagnosticCanBeCanceled) {
  load_port(R"("diagnostics": {"loopback": {"endless": true}})");
  std::uint32_t id = 0;
  RM_DiagResult result{};
  ASSERT_EQ(SIM_CALL(rm, LRM_DiagLoopBackTestV3, first_port, 1u, 1u, 0u, &id, 0u, "aa"), 0);
  for (int i = 0; i < 300; ++i) {
    ASSERT_EQ(SIM_CALL(rm, LRM_DiagGetResults, first_port, id, &result), 0);
    ASSERT_EQ(result.state, RM_DIAG_RUNNING + 0u);
  }
  EXPECT_EQ(SIM_CALL(rm, LRM_DiagCancelDiagnostic, first_port, id), 0);
  EXPECT_EQ(SIM_CALL(rm, LRM_DiagGetResults, first_port, id, &result), 0);
  EXPECT_EQ(result.state, RM_DIAG_CANCELED + 0u);
  EXPECT_NE(SIM_CALL(rm, LRM_DiagCancelDiagnostic, first_port, id), 0);
}

TEST_F(Management, TheTableOfDiagnosticsFillsUp) {
  load_port(R"("diagnostics": {"post": {"endless": true}})");
  std::uint32_t id = 0;
  for (int i = 0; i < 64; ++i) ASSERT_EQ(SIM_CALL(rm, LRM_DiagRunPOST, first_port, &id), 0);
  EXPECT_EQ(SIM_CALL(rm, LRM_DiagRunPOST, first_port, &id), RM_ERROR_DIAG_TABLE_FULL);
}

// An image file in a folder of the test's own.
class Firmware : public Management {
 protected:
  Firmware() : m_Folder(std::filesystem::temp_directory_path() / unique_name()) {
    std::filesystem::create_directory(m_Folder);
  }
  ~Firmware() override { std::filesystem::remove_all(m_Folder); }

  std::string image(const std::string& version, const std::string& model, std::string payload) {
    std::string bytes(64, '\0');
    bytes.replace(0, 8, "TVXFWIMG");
    bytes[8] = 1;
    put(bytes, 12, static_cast<std::uint32_t>(payload.size()));
    bytes.replace(16, version.size(), version);
    bytes.replace(32, model.size(), model);
    put(bytes, 48, crc(payload));
    return write(bytes + payload);
  }
  std::string write(const std::string& bytes) {
    const std::string path = m_Folder / ("image" + std::to_string(m_Count++));
    std::ofstream(path, std::ios::binary) << bytes;
    return path;
  }

 private:
  static std::string unique_name() { return "tvxsim_firmware_" + std::to_string(getpid()); }
  static void put(std::string& bytes, std::size_t at, std::uint32_t value) {
    for (std::size_t i = 0; i < 4; ++i) bytes[at + i] = static_cast<char>(value >> (8 * i));
  }
  static std::uint32_t crc(const std::string& payload) {
    std::uint32_t value = 0xFFFFFFFF;
    for (const char c : payload) {
      value ^= static_cast<std::uint8_t>(c);
      for (int bit = 0; bit < 8; ++bit) value = (value >> 1) ^ (value & 1 ? 0xEDB88320 : 0);
    }
    return ~value;
  }

  std::filesystem::path m_Folder;
  int m_Count = 0;
};

TEST_F(Firmware, AnImageIsVerifiedWrittenAndRunAfterTheReset) {
  const std::string path = image("2.02a1", "TVX16", "payload");
  EXPECT_EQ(SIM_CALL(rm, RM_ImportHBAFileA, path.c_str()), 0);
  EXPECT_EQ(SIM_CALL(rm, RM_VerifyFirmwareA, 0, first_port, path.c_str()), 0);
  EXPECT_EQ(SIM_CALL(rm, LRM_DownloadFirmware, first_port, path.c_str(), 0), 0);
  EXPECT_EQ(adapter_text(RM_HA_FIRMWARE_ON_FLASH), "2.02a1");
  EXPECT_EQ(adapter_text(RM_HA_FIRMWARE_ON_FLASH, second_port), "2.02a1");
  EXPECT_EQ(adapter_text(RM_HA_OPERATIONAL_FIRMWARE), "2.01a4");
  EXPECT_EQ(SIM_CALL(rm, LRM_ResetHBA, first_port, 1), 0);
  EXPECT_EQ(adapter_text(RM_HA_OPERATIONAL_FIRMWARE), "2.02a1");
}

TEST_F(Firmware, ARebootMayBeWantedInstead) {
  load_port(R"("firmware": {"activation": "reboot"})");
  const std::string path = image("2.02a1", "", "payload");
  EXPECT_EQ(SIM_CALL(rm, LRM_DownloadFirmware, first_port, path.c_str(), 0), RM_NEED_REBOOT);
  EXPECT_EQ(SIM_CALL(rm, LRM_ResetHBA, first_port, 1), 0);
  EXPECT_EQ(adapter_text(RM_HA_OPERATIONAL_FIRMWARE), "2.01a4");
}

TEST_F(Firmware, WrongImagesAreRefused) {
  std::string spoilt = image("2.02a1", "", "payload");
  std::ofstream(spoilt, std::ios::app) << "more";
  EXPECT_EQ(SIM_CALL(rm, RM_ImportHBAFileA, spoilt.c_str()), 145);
  EXPECT_EQ(SIM_CALL(rm, RM_ImportHBAFileA, write("").c_str()), 145);
  EXPECT_EQ(SIM_CALL(rm, RM_ImportHBAFileA, "/no/such/file"), 26);
  const std::string foreign = image("2.02a1", "TVX8", "payload");
  EXPECT_EQ(SIM_CALL(rm, RM_VerifyFirmwareA, 0, first_port, foreign.c_str()), 144);
  EXPECT_EQ(SIM_CALL(rm, LRM_DownloadFirmware, first_port, foreign.c_str(), 0), 144);
  EXPECT_EQ(adapter_text(RM_HA_FIRMWARE_ON_FLASH), "2.01a4");
}

}  // namespace
}  // namespace tvx::sim_test
