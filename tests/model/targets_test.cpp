// Discovery of targets behind a port.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <array>
#include <cstring>
#include <map>
#include <numeric>
#include <string>
#include <utility>
#include <vector>

#include "Fake_Host.h"
#include "common/TVX_Memory.h"
#include "model/TVX_Data.h"
#include "support/Log_Capture.h"

namespace cimrt {
namespace {

using testing::ElementsAre;
using tvx::test::Fake_Host;
using tvx::test::Log_Capture;
using tvx::test::Logged;
using tvx::test::wwnOf;

constexpr const char* FAILURE = "HBA_SendScsiInquiry_t(0x80) returns ";
constexpr const char* SENSE =
    "Sense Data: 01 02 03 04 05 06 07 08 09 0a 0b 0c 0d 0e 0f 10 11 12 13 14 15 16 17 18 ";
constexpr int CALL = 0;  // level of no message

/// The commands of a unit, by page; READ CAPACITY apart.
enum Command_Kind { STANDARD = 0, SERIAL = 0x80, IDENTIFICATION = 0x83, CAPACITY = 0x100 };

/// Where a command went: the handle, the last byte of the target's name, and the unit.
struct Address {
  HBA_HANDLE handle;
  int target;
  HBA_UINT64 lun;
  bool operator==(const Address&) const = default;
};

std::vector<std::size_t> allocated;  // sizes of the buffers that were asked for

class Targets : public testing::Test {
 protected:
  void SetUp() override {
    host.add("Torvex-A0", 1);
    host.libraries.provide(HBA_GetFcpTargetMapping,
                           [this](HBA_HANDLE, HBA_FCPTARGETMAPPING* out) { return map(out); });
    host.libraries.provide(
        HBA_SendScsiInquiry,
        [this](HBA_HANDLE handle, HBA_WWN target, HBA_UINT64 lun, HBA_UINT8 evpd, HBA_UINT32 page,
               void* response, HBA_UINT32 responseSize, void* sense, HBA_UINT32 senseSize) {
          EXPECT_EQ(responseSize, 255U);
          EXPECT_EQ(senseSize, 128U);
          EXPECT_EQ(evpd, page != 0 ? 1 : 0);
          addresses.push_back({handle, target.wwn[7], lun});
          return command(static_cast<Command_Kind>(page), response, sense);
        });
    host.libraries.provide(HBA_SendReadCapacity,
                           [this](HBA_HANDLE handle, HBA_WWN target, HBA_UINT64 lun, void* response,
                                  HBA_UINT32 responseSize, void* sense, HBA_UINT32 senseSize) {
                             EXPECT_EQ(responseSize, 255U);
                             EXPECT_EQ(senseSize, 128U);
                             addresses.push_back({handle, target.wwn[7], lun});
                             return command(CAPACITY, response, sense);
                           });
    data.buildAdapterData();
    capture.forget();
  }
  void TearDown() override {
    tvxSetAllocator(nullptr);
    data.freeAllData();
    EXPECT_EQ(host.open, 0);
  }

  /// Puts a call of the library between the lines of the log.
  void mark(const std::string& call) {
    if (callsAreMarked) capture.log(CALL, nullptr, nullptr, ("-> " + call).c_str());
  }

  HBA_STATUS map(HBA_FCPTARGETMAPPING* out) {
    mark("mapping of " + std::to_string(out->NumberOfEntries));
    asked.push_back(out->NumberOfEntries);
    const HBA_STATUS forced = asked.size() <= statuses.size() ? statuses[asked.size() - 1] : 0;
    if (forced != 0 && forced != 7) return forced;
    const auto needed = static_cast<HBA_UINT32>(rows.size());
    const bool fits = out->NumberOfEntries >= needed && forced == 0;
    if (fits) {
      std::copy(rows.begin(), rows.end(), out->entry);
    }
    out->NumberOfEntries = claimed != 0 ? claimed : needed;
    return fits ? 0 : 7;
  }

  HBA_STATUS command(Command_Kind kind, void* response, void* sense) {
    mark("command " + std::to_string(kind));
    if (sent.empty() || sent.back() != kind) {
      EXPECT_TRUE(isZero(response, 255) && isZero(sense, 128)) << "at the first try of " << kind;
    }
    sent.push_back(kind);
    std::vector<HBA_STATUS>& before = firstStatuses[kind];
    if (!before.empty()) {
      const HBA_STATUS status = before.front();
      before.erase(before.begin());
      return status;
    }
    auto& [status, text] = answers[kind];
    std::memcpy(response, text.data(), std::min<std::size_t>(text.size(), 255));
    auto* const senseBytes = static_cast<std::uint8_t*>(sense);
    std::iota(senseBytes, senseBytes + TVX_SCSI_SENSE_SIZE, std::uint8_t{1});
    return status;
  }

  static bool isZero(const void* place, std::size_t size) {
    const auto* bytes = static_cast<const std::uint8_t*>(place);
    return std::all_of(bytes, bytes + size, [](std::uint8_t byte) { return byte == 0; });
  }

  HBA_FCPSCSIENTRY& addRow(std::uint8_t number) {
    HBA_FCPSCSIENTRY row{};
    row.FcpId.PortWWN = wwnOf(0x50, number);
    row.FcpId.NodeWWN = wwnOf(0x51, number);
    return rows.emplace_back(row);
  }
  Port& port() { return *data.m_Ports.at(0); }
  Target& scanOne() {
    addRow(1);
    data.buildSANData();
    return *port().getTarget(0);
  }
  std::size_t failures(HBA_STATUS status) const {
    return capture.count(TVX_DBG, FAILURE + std::to_string(status) + ".");
  }

  Fake_Host host;
  Log_Capture capture;
  Data data;
  std::vector<HBA_FCPSCSIENTRY> rows;
  std::vector<HBA_STATUS> statuses;  // of the mapping calls
  bool callsAreMarked = false;
  HBA_UINT32 claimed = 0;         // count left in the buffer, if not 0
  std::vector<HBA_UINT32> asked;  // room of each mapping call
  std::map<Command_Kind, std::pair<HBA_STATUS, std::string>> answers;
  std::map<Command_Kind, std::vector<HBA_STATUS>> firstStatuses;  // before those answers
  std::vector<int> sent;
  std::vector<Address> addresses;  // to which they were sent
};

// ---- The mapping ----

TEST_F(Targets, OneForEachRow) {
  addRow(1);
  addRow(1);
  addRow(2);
  data.buildSANData();
  EXPECT_THAT(asked, ElementsAre(256U));
  EXPECT_EQ(port().getNumberOfTargets(), 3U);
  EXPECT_EQ(port().getTarget(2)->portWWN, "5000000000000002");
  for (const char* text :
       {"buildSANData", "Target Scan from adapter: Torvex-A0", "FCAdapter::rescanTargets",
        "FCPort::rescanTargets", "To retry the HBA_GetFcpTargetMapping command",
        "Deleting the allocated memory", "All Ok ...break ", "Successful target info fetched",
        "Creating Target...", "End Creating Target..."}) {
    EXPECT_TRUE(capture.has(TVX_DBG, text)) << text;
  }
}

TEST_F(Targets, ARescanReplacesTheOldOnes) {
  addRow(1);
  data.buildSANData();
  rows.clear();
  addRow(2);
  data.buildSANData();
  EXPECT_EQ(capture.count(TVX_DBG, "Freeing Target: 5000000000000001"), 1U);
  ASSERT_EQ(port().getNumberOfTargets(), 1U);
  EXPECT_EQ(port().getTarget(0)->portWWN, "5000000000000002");
}

TEST_F(Targets, APortWithoutMappingsHasNone) {
  data.buildSANData();
  EXPECT_TRUE(capture.has(TVX_DBG, "HBA_GetFcpTargetMapping_t() found no target mappings"));
  EXPECT_EQ(port().getNumberOfTargets(), 0U);
  EXPECT_EQ(host.open, 0);
}

TEST_F(Targets, AVanishedAdapterLeavesThePortEmpty) {
  addRow(1);
  data.buildSANData();
  host.adapters[0].opens = false;
  capture.forget();
  data.buildSANData();
  EXPECT_LT(capture.position("Freeing Target: 5000000000000001"),
            capture.position("HBA_OpenAdapter failed, skipping Adapter Torvex-A0"));
  EXPECT_EQ(port().getNumberOfTargets(), 0U);
  EXPECT_TRUE(capture.has(TVX_ERR, "HBA_OpenAdapter failed, skipping Adapter Torvex-A0"));
  EXPECT_TRUE(capture.has(TVX_ERR, "Issue with Target Rescan - moving to the next Port"));
}

TEST_F(Targets, ALongerMappingIsReadAgain) {
  for (int i = 0; i < 300; ++i) addRow(static_cast<std::uint8_t>(i));
  data.buildSANData();
  EXPECT_THAT(asked, ElementsAre(256U, 300U));
  EXPECT_EQ(port().getNumberOfTargets(), 300U);
  EXPECT_TRUE(capture.has(TVX_DBG, "Increasing the buffer to = 300"));
}

TEST_F(Targets, StaleDataAreRefreshed) {
  addRow(1);
  statuses = {8};
  data.buildSANData();
  EXPECT_EQ(host.refreshed, 1);
  EXPECT_THAT(asked, ElementsAre(256U, 256U));
  EXPECT_TRUE(capture.has(TVX_DBG, "Refresh and retry ... "));
  EXPECT_EQ(port().getNumberOfTargets(), 1U);
}

TEST_F(Targets, ThreeTriesAreAll) {
  for (const HBA_STATUS status : {7U, 8U}) {
    capture.forget();
    asked.clear();
    rows.clear();
    addRow(1);
    statuses.assign(3, status);
    data.buildSANData();
    EXPECT_EQ(asked.size(), 3U);
    EXPECT_EQ(host.refreshed, status == 8 ? 3 : 0);
    EXPECT_EQ(port().getNumberOfTargets(), 0U);
    EXPECT_TRUE(capture.has(TVX_DBG, "Successful target info fetched"));
    EXPECT_FALSE(capture.has(TVX_DBG, "All Ok ...break "));
  }
}

TEST_F(Targets, AMappingThatGrowsOnIsAskedWithMoreRoomEachTime) {
  HBA_UINT32 grown = 300;
  host.libraries.provide(HBA_GetFcpTargetMapping, [&](HBA_HANDLE, HBA_FCPTARGETMAPPING* out) {
    asked.push_back(out->NumberOfEntries);
    out->NumberOfEntries = grown;
    grown += 300;
    return HBA_STATUS{HBA_STATUS_ERROR_MORE_DATA};
  });
  data.buildSANData();
  EXPECT_THAT(asked, ElementsAre(256U, 300U, 600U));
  for (const char* room : {"300", "600", "900"})
    EXPECT_EQ(capture.count(TVX_DBG, std::string("Increasing the buffer to = ") + room), 1U);
  EXPECT_TRUE(capture.has(TVX_DBG, "Successful target info fetched"));
  EXPECT_TRUE(capture.allAt(TVX_DBG)) << "the exhausted tries have no line of their own";
  EXPECT_EQ(port().getNumberOfTargets(), 0U);
}

TEST_F(Targets, AnEmptyMappingIsToldOfWhateverTheStatus) {
  host.libraries.provide(HBA_GetFcpTargetMapping, [&](HBA_HANDLE, HBA_FCPTARGETMAPPING* out) {
    asked.push_back(out->NumberOfEntries);
    out->NumberOfEntries = 0;
    return HBA_STATUS{HBA_STATUS_ERROR_MORE_DATA};
  });
  data.buildSANData();
  EXPECT_THAT(asked, ElementsAre(256U, 0U, 0U)) << "the room that it says it needs";
  EXPECT_EQ(capture.count(TVX_DBG, "HBA_GetFcpTargetMapping_t() found no target mappings"), 1U);
  EXPECT_EQ(port().getNumberOfTargets(), 0U);
}

TEST_F(Targets, TheBufferHoldsTheToldRowsBehindItsHeader) {
  for (int i = 0; i < 300; ++i) addRow(static_cast<std::uint8_t>(i));
  allocated.clear();
  tvxSetAllocator([](std::size_t size) -> void* {
    allocated.push_back(size);
    return std::calloc(1, size);
  });
  data.buildSANData();
  EXPECT_THAT(allocated, ElementsAre(8U + 256 * 304, 8U + 300 * 304));
  EXPECT_EQ(port().getTarget(299)->portWWN, "500000000000002B");
}

TEST_F(Targets, WithoutMemoryForMoreRowsThereAreNone) {
  for (int i = 0; i < 300; ++i) addRow(static_cast<std::uint8_t>(i));
  allocated.clear();
  tvxSetAllocator([](std::size_t size) -> void* {
    allocated.push_back(size);
    return allocated.size() == 1 ? std::calloc(1, size) : nullptr;
  });
  data.buildSANData();
  EXPECT_THAT(asked, ElementsAre(256U));
  EXPECT_EQ(capture.count(TVX_CRIT, "Could not allocate memory..break "), 1U);
  EXPECT_FALSE(capture.has(TVX_DBG, "Successful target info fetched"));
  EXPECT_EQ(port().getNumberOfTargets(), 0U);
}

TEST_F(Targets, TheCountIsReadAfreshForEachRow) {
  for (std::uint8_t i = 1; i <= 5; ++i) addRow(i);
  HBA_FCPTARGETMAPPING* kept = nullptr;
  host.libraries.provide(HBA_GetFcpTargetMapping, [&](HBA_HANDLE, HBA_FCPTARGETMAPPING* out) {
    kept = out;
    return map(out);
  });
  host.libraries.provide(HBA_SendReadCapacity, [&](HBA_HANDLE, HBA_WWN target, HBA_UINT64, void*,
                                                   HBA_UINT32, void*, HBA_UINT32) {
    if (target.wwn[7] == 2) kept->NumberOfEntries = 3;
    return HBA_STATUS{0};
  });
  data.buildSANData();
  EXPECT_EQ(port().getNumberOfTargets(), 3U);
}

TEST_F(Targets, AnotherFailureEndsTheScan) {
  addRow(1);
  statuses = {12};
  data.buildSANData();
  EXPECT_EQ(asked.size(), 1U);
  EXPECT_EQ(port().getNumberOfTargets(), 0U);
  EXPECT_TRUE(capture.has(TVX_ERR, "Error hbaStatus=12"));
  EXPECT_FALSE(capture.has(TVX_DBG, "Successful target info fetched"));
}

TEST_F(Targets, AnEmptyMappingIsNotToldOfWhereTheCallFailed) {
  host.libraries.provide(HBA_GetFcpTargetMapping, [](HBA_HANDLE, HBA_FCPTARGETMAPPING* out) {
    out->NumberOfEntries = 0;
    return HBA_STATUS{12};
  });
  data.buildSANData();
  EXPECT_TRUE(capture.has(TVX_ERR, "Error hbaStatus=12"));
  EXPECT_FALSE(capture.has(TVX_DBG, "HBA_GetFcpTargetMapping_t() found no target mappings"));
}

TEST_F(Targets, WithoutMemoryThereAreNone) {
  addRow(1);
  tvxSetAllocator([](std::size_t) -> void* { return nullptr; });
  data.buildSANData();
  EXPECT_TRUE(asked.empty());
  EXPECT_TRUE(capture.has(TVX_CRIT, "Could not allocate memory..break "));
}

TEST_F(Targets, CountsThatNoSanHasAreNotAllocated) {
  statuses = {7};
  claimed = 0xFFFFFFFF;
  data.buildSANData();
  EXPECT_EQ(asked.size(), 1U);
  EXPECT_TRUE(capture.has(TVX_DBG, "Increasing the buffer to = -1"));
  EXPECT_TRUE(capture.has(TVX_CRIT, "Could not allocate memory..break "));
}

TEST_F(Targets, ACountBeyondTheBufferIsNotBelieved) {
  addRow(1);
  claimed = 0x00FFFFFF;
  data.buildSANData();
  EXPECT_EQ(port().getNumberOfTargets(), 256U);
}

TEST_F(Targets, ARowWhoseAdapterDoesNotOpenIsSkipped) {
  addRow(1);
  addRow(2);
  int opens = 0;
  host.libraries.provide(HBA_OpenAdapter, [&](char*) -> HBA_HANDLE {
    if (++opens == 2) return 0;  // the port, row 0, row 1
    ++host.open;
    return 1;
  });
  data.buildSANData();
  EXPECT_TRUE(capture.has(TVX_ERR, "HBA_OpenAdapter failed, skipping Adapter Torvex-A0"));
  EXPECT_TRUE(capture.has(TVX_ERR, "target creation failed - moving to the next target"));
  ASSERT_EQ(port().getNumberOfTargets(), 1U);
  EXPECT_EQ(port().getTarget(0)->portWWN, "5000000000000002");
}

// ---- A scan that is stopped ----

TEST_F(Targets, AStoppedScanEndsBeforeTheNextUnit) {
  for (std::uint8_t i = 1; i <= 5; ++i) addRow(i);
  host.libraries.provide(HBA_SendReadCapacity,
                         [this](HBA_HANDLE, HBA_WWN target, HBA_UINT64, void* response, HBA_UINT32,
                                void* sense, HBA_UINT32) {
                           if (target.wwn[7] == 2) data.stopScan();
                           return command(CAPACITY, response, sense);
                         });
  data.buildSANData();
  EXPECT_EQ(port().getNumberOfTargets(), 2U);
  EXPECT_EQ(host.open, 0);
  EXPECT_EQ(sent.size(), 8U);
}

TEST_F(Targets, AStoppedTreeIsNotScanned) {
  addRow(1);
  data.buildSANData();
  data.stopScan();
  asked.clear();
  data.buildSANData();
  EXPECT_TRUE(asked.empty());
  EXPECT_EQ(port().getNumberOfTargets(), 1U);
}

TEST_F(Targets, AStoppedScanLeavesTheOtherPortsAndAdaptersAlone) {
  host.add("Torvex-A1", 2);
  host.add("Torvex-A2", 1);
  data.buildAdapterData();
  addRow(1);
  host.libraries.provide(HBA_SendReadCapacity, [this](HBA_HANDLE handle, HBA_WWN, HBA_UINT64, void*,
                                                      HBA_UINT32, void*, HBA_UINT32) {
    if (handle == 2) data.stopScan();
    return HBA_STATUS{0};
  });
  data.buildSANData();
  EXPECT_EQ(asked.size(), 2U) << "the only port of the first adapter, the first of the second";
  EXPECT_EQ(data.m_Ports.at(1)->getNumberOfTargets(), 1U) << "what was under way is kept";
  EXPECT_FALSE(capture.has(TVX_DBG, "Target Scan from adapter: Torvex-A2"));
}

TEST_F(Targets, ThePortAfterOneThatVanishedIsScanned) {
  host.add("Torvex-A1", 2);
  data.buildAdapterData();
  addRow(1);
  data.buildSANData();
  int opens = 0;
  host.libraries.provide(HBA_OpenAdapter, [&](char*) -> HBA_HANDLE {
    if (++opens == 3) return 0;  // adapter 0: its port, its row; then the first port of adapter 1
    ++host.open;
    return 1;
  });
  data.buildSANData();
  EXPECT_TRUE(capture.has(TVX_ERR, "Issue with Target Rescan - moving to the next Port"));
  EXPECT_EQ(data.m_Ports[0]->getNumberOfTargets(), 1U);
  EXPECT_EQ(data.m_Ports[1]->getNumberOfTargets(), 0U);
  EXPECT_EQ(data.m_Ports[2]->getNumberOfTargets(), 1U);
}

// ---- The trace ----

TEST_F(Targets, AScanIsToldStepByStepAndEachCommandOnceBeforeItIsSent) {
  callsAreMarked = true;
  host.libraries.provide(HBA_RefreshInformation, [this](HBA_HANDLE handle) {
    mark("refresh of " + std::to_string(handle));
  });
  addRow(0x1F);
  statuses = {8, 7};
  firstStatuses[STANDARD] = {9};
  answers[STANDARD].second = "\x04";
  answers[SERIAL].first = 9;
  answers[IDENTIFICATION].first = 9;
  answers[CAPACITY].first = 12;
  data.buildSANData();
  const std::string failure = FAILURE;
  EXPECT_THAT(
      capture.texts(),
      ElementsAre("buildSANData", "Target Scan from adapter: Torvex-A0", "FCAdapter::rescanTargets",
                  "FCPort::rescanTargets",  //
                  "To retry the HBA_GetFcpTargetMapping command", "Deleting the allocated memory",
                  "-> mapping of 256", "-> refresh of 1", "Refresh and retry ... ",
                  "To retry the HBA_GetFcpTargetMapping command", "Deleting the allocated memory",
                  "-> mapping of 256", "Increasing the buffer to = 1",
                  "To retry the HBA_GetFcpTargetMapping command", "Deleting the allocated memory",
                  "-> mapping of 1", "All Ok ...break ", "Successful target info fetched",  //
                  "Creating Target...", "Node WWN: 510000000000001F", "Port WWN: 500000000000001F",
                  "SCSI Inquiry with 0, 0", "-> command 0", "-> command 0", "DeviceType......4",
                  "SCSI Inquiry with 1, 0x80", "-> command 128", "-> command 128", "-> command 128",
                  failure + "9.",  //
                  "SCSI Inquiry with 1, 0x83", "-> command 131", "-> command 131", "-> command 131",
                  failure + "9.", SENSE,  //
                  "Send Read Capacity", "-> command 256", failure + "12.",
                  "End Creating Target..."));
  for (const Logged& line : capture.lines())
    EXPECT_EQ(line.level, line.text.starts_with("-> ") ? CALL : TVX_DBG) << line.text;
}

// ---- One unit ----

TEST_F(Targets, AUnitIsAskedOverAHandleOfItsOwn) {
  addRow(1).FcpId.FcpLun = 0x0700;
  addRow(2);
  HBA_HANDLE next = 20;
  std::vector<std::string> calls;
  host.libraries.provide(HBA_OpenAdapter, [&](char* name) {
    EXPECT_STREQ(name, "Torvex-A0");
    calls.push_back("open " + std::to_string(++next));
    return next;
  });
  // The handle is closed before the unit is told to be done.
  host.libraries.provide(HBA_CloseAdapter, [&](HBA_HANDLE handle) {
    const std::size_t done = capture.count(TVX_DBG, "End Creating Target...");
    calls.push_back("close " + std::to_string(handle) + ", done " + std::to_string(done));
  });
  host.libraries.provide(HBA_GetFcpTargetMapping,
                         [&](HBA_HANDLE handle, HBA_FCPTARGETMAPPING* out) {
                           EXPECT_EQ(handle, 21U);
                           return map(out);
                         });
  data.buildSANData();
  EXPECT_THAT(calls, ElementsAre("open 21", "open 22", "close 22, done 0", "open 23",
                                 "close 23, done 1", "close 21, done 2"));
  const Address first{22, 1, 0x0700};
  const Address second{23, 2, 0};
  EXPECT_THAT(addresses, ElementsAre(first, first, first, first, second, second, second, second));
}

TEST_F(Targets, TakesTheRow) {
  HBA_FCPSCSIENTRY& row = addRow(0x1F);
  row.FcpId.FcId = 0x010203;
  row.FcpId.FcpLun = 0x0102030405060708;
  std::strcpy(row.ScsiId.OSDeviceName, "/dev/sdx");
  row.ScsiId.ScsiBusNumber = 1;
  row.ScsiId.ScsiTargetNumber = 2;
  row.ScsiId.ScsiOSLun = 3;
  data.buildSANData();
  const Target& target = *port().getTarget(0);
  EXPECT_EQ(target.fcId, 0x010203U);
  EXPECT_EQ(target.nodeWWN, "510000000000001F");
  EXPECT_EQ(target.portWWN, "500000000000001F");
  EXPECT_EQ(target.fcpLun, 0x0102030405060708U);
  EXPECT_EQ(target.osDeviceName, "/dev/sdx");
  EXPECT_EQ(target.scsiBusNumber, 1U);
  EXPECT_EQ(target.scsiTargetNumber, 2U);
  EXPECT_EQ(target.scsiOSLun, 3U);
  const std::size_t begin = capture.position("Creating Target...");
  EXPECT_EQ(capture.lines().at(begin + 1), (Logged{TVX_DBG, "Node WWN: 510000000000001F"}));
  EXPECT_EQ(capture.lines().at(begin + 2), (Logged{TVX_DBG, "Port WWN: 500000000000001F"}));
}

TEST_F(Targets, TheNameOfTheSystemMayFillItsField) {
  char(&field)[256] = addRow(1).ScsiId.OSDeviceName;
  std::fill(std::begin(field), std::end(field), 'n');
  data.buildSANData();
  EXPECT_EQ(port().getTarget(0)->osDeviceName, std::string(256, 'n'));
}

TEST_F(Targets, SendsFourCommandsInOrder) {
  scanOne();
  EXPECT_THAT(sent, ElementsAre(STANDARD, SERIAL, IDENTIFICATION, CAPACITY));
  const std::size_t first = capture.position("SCSI Inquiry with 0, 0");
  const std::size_t second = capture.position("SCSI Inquiry with 1, 0x80");
  const std::size_t third = capture.position("SCSI Inquiry with 1, 0x83");
  const std::size_t fourth = capture.position("Send Read Capacity");
  EXPECT_LT(first, second);
  EXPECT_LT(second, third);
  EXPECT_LT(third, fourth);
  EXPECT_LT(fourth, capture.lines().size());
  EXPECT_TRUE(capture.allAt(TVX_DBG)) << "a scan without failures is a trace";
}

TEST_F(Targets, TakesTheStandardInquiry) {
  std::string page(36, ' ');
  page[0] = '\x61';  // the upper three bits do not count
  page.replace(8, 8, "TORVEX  ");
  page.replace(16, 16, "ARRAY           ");
  page.replace(32, 4, "12\0 ", 4);
  answers[STANDARD].second = page;
  const Target& target = scanOne();
  EXPECT_EQ(target.deviceType, 1U);
  EXPECT_EQ(target.vendor, "TORVEX  ");
  EXPECT_EQ(target.model, "ARRAY           ");
  EXPECT_EQ(target.revision, "12");
  EXPECT_TRUE(capture.has(TVX_DBG, "DeviceType......1"));
}

TEST_F(Targets, TakesTheSerialNumber) {
  answers[SERIAL].second = std::string("\0\x80\0\x04SER1\0rest", 13);
  EXPECT_EQ(scanOne().serialNumber, "SER1");
}

TEST_F(Targets, ASerialNumberWithoutAnEndIsBounded) {
  answers[SERIAL].second = std::string(255, 's');
  EXPECT_EQ(scanOne().serialNumber, std::string(251, 's'));
}

TEST_F(Targets, TakesTheFirstIdentificationDescriptor) {
  std::string page(255, '\x11');
  page.replace(0, 8, std::string("\x25\x83\x12\x34\xF1\xA3\x00\x04", 8));
  page.replace(8, 4, "IDEN");
  answers[IDENTIFICATION].second = page;
  const DeviceIdentification& id = scanOne().deviceIdentification;
  EXPECT_EQ(id.peripheralType, 5);
  EXPECT_EQ(id.pageCode, 0x83);
  EXPECT_EQ(id.pageLength, 0x34U);
  EXPECT_EQ(id.identifierType, 3U);
  EXPECT_EQ(id.identifierLength, 4U);
  EXPECT_EQ(std::string(id.identifier.begin(), id.identifier.begin() + 4), "IDEN");
  EXPECT_EQ(id.identifier[4], 0);
}

TEST_F(Targets, AnIdentifierBehindTheResponseIsBounded) {
  std::array<std::uint8_t, 255> page{};
  page.fill(7);
  page[7] = 255;
  DeviceIdentification id;
  EXPECT_EQ(parseDeviceIdentification(&id, page.data()), 0);
  EXPECT_EQ(id.identifierLength, 255U);
  EXPECT_EQ(id.identifier[246], 7);
  EXPECT_EQ(id.identifier[247], 0);
  EXPECT_EQ(parseDeviceIdentification(nullptr, page.data()), 0x8001);
}

TEST_F(Targets, TakesTheCapacity) {
  answers[CAPACITY].second = std::string("\x01\x02\x03\x04\x80\x00\x02\x00", 8);
  const Target& target = scanOne();
  EXPECT_EQ(target.blockCount, 0x01020304U);
  EXPECT_EQ(target.blockSize, 0x80000200U);
}

TEST_F(Targets, ADeadUnitStaysVisible) {
  for (const Command_Kind kind : {STANDARD, SERIAL, IDENTIFICATION, CAPACITY}) {
    answers[kind] = {12, std::string(255, '\xFF')};
  }
  const Target& target = scanOne();
  EXPECT_EQ(target.vendor, "Unknown");
  EXPECT_EQ(target.model, "Unknown");
  EXPECT_EQ(target.revision, "Unknown");
  EXPECT_EQ(target.serialNumber, "Unknown");
  EXPECT_EQ(target.deviceType, 0U);
  EXPECT_EQ(target.deviceIdentification.identifierType, 0U);
  EXPECT_EQ(target.deviceIdentification.identifierLength, 0U);
  EXPECT_EQ(target.blockCount, 0U);
  EXPECT_EQ(target.blockSize, 0U);
  EXPECT_EQ(failures(12), 4U);
  EXPECT_EQ(sent.size(), 4U);  // no other status is repeated
}

TEST_F(Targets, CheckConditionsAreTriedThreeTimesEach) {
  answers[STANDARD].first = 9;
  const Target& target = scanOne();
  EXPECT_THAT(sent, ElementsAre(STANDARD, STANDARD, STANDARD, SERIAL, IDENTIFICATION, CAPACITY));
  EXPECT_EQ(target.vendor, "Unknown");
  EXPECT_EQ(failures(9), 1U);
  for (const std::string& text : capture.texts()) EXPECT_FALSE(text.starts_with("Sense Data"));
}

TEST_F(Targets, EveryCommandIsTriedThreeTimes) {
  const Command_Kind kinds[] = {STANDARD, SERIAL, IDENTIFICATION, CAPACITY};
  for (const Command_Kind kind : kinds) {
    answers.clear();
    answers[kind].first = 9;
    rows.clear();
    sent.clear();
    capture.forget();
    scanOne();
    for (const Command_Kind other : kinds)
      EXPECT_EQ(std::count(sent.begin(), sent.end(), other), other == kind ? 3 : 1) << kind;
    EXPECT_EQ(sent.back(), CAPACITY) << "the next command is still sent";
    EXPECT_EQ(failures(9), 1U) << kind;
  }
}

TEST_F(Targets, AUnitThatRecoversIsTakenAsItAnswers) {
  std::string page(96, 'x');
  page[0] = '\x05';
  page.replace(8, 6, "VENDOR");
  answers[STANDARD].second = page;
  answers[SERIAL].second = std::string("\0\x80\0\x04SER1", 8);
  answers[IDENTIFICATION].second = std::string("\0\x83\0\x09\x01\x02\0\x01I", 9);
  answers[CAPACITY].second = std::string("\0\0\0\x07\0\0\x02\0", 8);
  for (const Command_Kind kind : {STANDARD, SERIAL, IDENTIFICATION, CAPACITY})
    firstStatuses[kind] = {9, 9};
  const Target& target = scanOne();
  EXPECT_EQ(sent.size(), 12U);
  EXPECT_EQ(target.deviceType, 5U);
  EXPECT_EQ(target.vendor, "VENDORxx");
  EXPECT_EQ(target.revision, "xxxx");
  EXPECT_EQ(target.serialNumber, "SER1");
  EXPECT_EQ(target.deviceIdentification.identifierType, 2U);
  EXPECT_EQ(target.blockCount, 7U);
  EXPECT_EQ(failures(9), 0U);
}

TEST_F(Targets, AnotherStatusEndsTheTries) {
  for (const Command_Kind kind : {STANDARD, SERIAL, IDENTIFICATION, CAPACITY}) {
    firstStatuses[kind] = {9};
    answers[kind].first = 12;
  }
  scanOne();
  EXPECT_EQ(sent.size(), 8U);
  EXPECT_EQ(failures(12), 4U);
  for (const std::string& text : capture.texts()) EXPECT_FALSE(text.starts_with("Sense Data"));
}

TEST_F(Targets, AFailedIdentificationLogsTheSenseData) {
  answers[IDENTIFICATION] = {9, std::string(255, '\xFF')};
  const DeviceIdentification& id = scanOne().deviceIdentification;
  EXPECT_EQ(id.peripheralType, 0);
  EXPECT_EQ(id.pageCode, 0);
  EXPECT_EQ(id.pageLength, 0U);
  EXPECT_EQ(id.identifierType, 0U);
  EXPECT_EQ(id.identifierLength, 0U);
  EXPECT_TRUE(isZero(id.identifier.data(), id.identifier.size()));
  EXPECT_EQ(capture.count(TVX_DBG, SENSE), 1U);
  EXPECT_EQ(failures(9), 1U);
}

TEST_F(Targets, ADeviceWithoutCapacityHasNone) {
  answers[CAPACITY].first = 9;
  const Target& target = scanOne();
  EXPECT_EQ(target.blockCount, 0U);
  EXPECT_EQ(target.blockSize, 0U);
}

}  // namespace
}  // namespace cimrt
