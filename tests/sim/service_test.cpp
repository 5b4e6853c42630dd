// Names, dumps, optimized access, virtual ports, diagnostics and firmware.
#include <unistd.h>

#include <filesystem>
#include <fstream>
#include <functional>
#include <string>
#include <vector>

#include "sim/Management.h"

namespace tvx::sim_test {
namespace {

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

// The tests that a port runs by a plan, and how each is started.
class Planned_Tests : public Management {
 protected:
  struct Planned {
    const char* plan;
    const char* call;
    std::function<RM_STATUS(std::uint32_t*)> start;
  };
  const std::vector<Planned> planned = {
      {"post", "LRM_DiagRunPOST",
       [this](std::uint32_t* made) { return SIM_CALL(rm, LRM_DiagRunPOST, first_port, made); }},
      {"echo", "LRM_DiagEchoTestV2",
       [this](std::uint32_t* made) {
         return SIM_CALL(rm, LRM_DiagEchoTestV2, first_port, wwn(9), 5u, 1u, made, 0u, "aa");
       }},
      {"loopback", "LRM_DiagLoopBackTestV3",
       [this](std::uint32_t* made) {
         return SIM_CALL(rm, LRM_DiagLoopBackTestV3, first_port, 1u, 5u, 0u, made, 0u, "aa");
       }},
      {"pci", "LRM_DiagPciLoopBackTestV2",
       [this](std::uint32_t* made) {
         return SIM_CALL(rm, LRM_DiagPciLoopBackTestV2, first_port, 5u, 0u, made, 0u, "aa");
       }},
  };
  void load_plan(const Planned& test, const std::string& plan) {
    load_port(std::string(R"("diagnostics": {")") + test.plan + R"(": )" + plan + "}");
  }
  RM_STATUS poll() { return SIM_CALL(rm, LRM_DiagGetResults, first_port, id, &result); }
  RM_DiagResult result{};
  std::uint32_t id = 0;
};

TEST_F(Planned_Tests, EndWithAnyResult) {
  for (const Planned& test : planned)
    for (const std::uint32_t code : {0u, 1u, 10u, 19u, 20u, 0xFFFFFFFFu}) {
      load_plan(test, R"({"polls": 0, "result": )" + std::to_string(code) + "}");
      ASSERT_EQ(test.start(&id), 0) << test.plan;
      EXPECT_EQ(poll(), 0);
      EXPECT_EQ(result.state, RM_DIAG_DONE + 0u) << test.plan;
      EXPECT_EQ(result.result, code) << test.plan;
    }
}

TEST_F(Planned_Tests, CanBeRefused) {
  for (const Planned& test : planned)
    for (const int status : {64, 63, 2, 190, 62}) {
      load_plan(test, "{}");
      const std::string fault = std::string(R"({"call": ")") + test.call + R"(", "status": )" +
                                std::to_string(status) + "}";
      ASSERT_EQ(tvxsim_add_fault(fault.c_str()), 0) << tvxsim_last_error();
      EXPECT_EQ(test.start(&id), status) << test.plan;
      tvxsim_clear_faults();
      EXPECT_EQ(test.start(&id), 0) << test.plan;
    }
}

TEST_F(Planned_Tests, ThatAreEndlessCanBeCanceled) {
  for (const Planned& test : planned) {
    load_plan(test, R"({"endless": true})");
    ASSERT_EQ(test.start(&id), 0) << test.plan;
    for (int i = 0; i < 300; ++i) {
      ASSERT_EQ(poll(), 0);
      ASSERT_EQ(result.state, RM_DIAG_RUNNING + 0u);
    }
    EXPECT_EQ(SIM_CALL(rm, LRM_DiagCancelDiagnostic, first_port, id), 0);
    EXPECT_EQ(poll(), 0);
    EXPECT_EQ(result.state, RM_DIAG_CANCELED + 0u) << test.plan;
    EXPECT_NE(SIM_CALL(rm, LRM_DiagCancelDiagnostic, first_port, id), 0);
  }
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

TEST_F(Firmware, NamesThatTellTheVersionFollowTheFirmwareThatRuns) {
  ASSERT_EQ(tvxsim_load_text(R"({"cards": [
      {"model": "TVX16002", "node_symbolic_name": "TVX16002 12.01a4 FV2.01a4 DV2.01a41, 2.01a4",
       "ports": [{"wwpn": "10000254560C4110"},
                 {"wwpn": "10000254560C4111", "symbolic_name": "no version"}]},
      {"model": "TVX16001", "node_symbolic_name": "other 2.01a4",
       "ports": [{"wwpn": "10000254560C4112"}]}]})"),
            0)
      << tvxsim_last_error();
  const auto told = [this](const char* adapter) {
    const HBA_HANDLE handle = open(adapter);
    HBA_ADAPTERATTRIBUTES card{};
    HBA_PORTATTRIBUTES port{};
    EXPECT_EQ(SIM_CALL(hba, HBA_GetAdapterAttributes, handle, &card), 0u);
    EXPECT_EQ(SIM_CALL(hba, HBA_GetAdapterPortAttributes, handle, 0u, &port), 0u);
    SIM_CALL(hba, HBA_CloseAdapter, handle);
    return std::vector<std::string>{card.FirmwareVersion, card.NodeSymbolicName,
                                    port.PortSymbolicName};
  };
  using Texts = std::vector<std::string>;
  const Texts before = {"2.01a4", "TVX16002 12.01a4 FV2.01a4 DV2.01a41, 2.01a4",
                        "TVX16002 12.01a4 FV2.01a4 DV2.01a41, 2.01a4 PORT-0"};
  const std::string name = "TVX16002 12.01a4 FV2.02a1 DV2.01a41, 2.02a1";
  EXPECT_EQ(told("Torvex-TVX16002-1"), before);
  const std::string path = image("2.02a1", "TVX16", "payload");
  ASSERT_EQ(SIM_CALL(rm, LRM_DownloadFirmware, first_port, path.c_str(), 0), 0);
  EXPECT_EQ(told("Torvex-TVX16002-1"), before) << "on flash, but not running";
  ASSERT_EQ(SIM_CALL(rm, LRM_ResetHBA, first_port, 1), 0);
  EXPECT_EQ(told("Torvex-TVX16002-1"), (Texts{"2.02a1", name, name + " PORT-0"}));
  EXPECT_EQ(told("Torvex-TVX16002-2"), (Texts{"2.02a1", name, "no version"}));
  EXPECT_EQ(adapter_text(RM_HA_NODE_SYMBOLIC_NAME), name);
  EXPECT_EQ(told("Torvex-TVX16001-3"), (Texts{"2.01a4", "other 2.01a4", "other 2.01a4 PORT-0"}));
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
