// World wide names: what the wrapper asks the library, waits for, tells and logs.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <stdexcept>
#include <string>
#include <vector>

#include "access/TVX_MethodWrapper.h"
#include "common/TVX_Clock.h"
#include "support/Fake_Libraries.h"
#include "support/Log_Capture.h"

namespace cimrt {
namespace {

using testing::ElementsAre;
using tvx::test::Fake_Libraries;
using tvx::test::Log_Capture;
using tvx::test::Logged;

HBA_WWN name(std::uint8_t last) {
  return {{0x10, 0, 0, 0, 0, 0, 0xAB, last}};
}

std::vector<std::uint64_t> sleeps;

class Wwn_Management : public testing::Test {
 protected:
  void SetUp() override {
    libraries.load();
    sleeps.clear();
    tvxSetSleep([](std::uint64_t usec) { sleeps.push_back(usec); });
    libraries.provide(RM_ValidateWwn, [](HBA_WWN) { return 0; });
    libraries.provide(LRM_ChangeWWN, [this](HBA_WWN, HBA_WWN, HBA_WWN, std::uint32_t,
                                            std::uint32_t* out) { return answer(out); });
    libraries.provide(LRM_RestoreWWN,
                      [this](HBA_WWN, std::uint32_t, std::uint32_t* out) { return answer(out); });
    libraries.provide(LRM_ReadWWN, [this](HBA_WWN, std::uint32_t, HBA_WWN* port, HBA_WWN* node,
                                          std::uint32_t* out) {
      EXPECT_EQ(*out, 0U);
      *port = name(0x0C);
      *node = name(0x0D);
      return answer(out);
    });
    operation.set(std::uint16_t{65535});
    result.null = wwpn.null = wwnn.null = capability.null = 1;
    capture.forget();
  }
  void TearDown() override { tvxSetSleep(nullptr); }

  /// What the next call of the library answers: the front of `statuses`, or its last one.
  RM_STATUS answer(std::uint32_t* out) {
    ++calls;
    *out = told;
    if (throwsAt == calls) throw std::runtime_error("in the library");
    const RM_STATUS status = statuses.front();
    if (statuses.size() > 1) statuses.erase(statuses.begin());
    return status;
  }

  void change() { TVX_MethodWrapper::ChangeWWN(name(1), name(2), name(3), 0, operation, result); }
  void restore() { TVX_MethodWrapper::RestoreWWN(name(1), 0, operation, result); }
  void read(std::uint16_t type) {
    TVX_MethodWrapper::ReadWWN(name(1), type, wwpn, wwnn, operation, result);
  }
  void getCapability() { TVX_MethodWrapper::GetWWNCapability(name(1), capability, result); }

  /// Local ports, each with its virtual ports, as the library lists them.
  void providePorts(std::vector<HBA_WWN> ports) {
    libraries.provide(RM_GetNumberOfLocalAdapters,
                      [ports] { return static_cast<std::uint32_t>(ports.size()); });
    libraries.provide(RM_GetLocalHBAInfo,
                      [ports](const RM_LocalHBASelector* selector, RM_LocalHBAInfo* info) {
                        EXPECT_EQ(info->rest[163], 0);
                        if (ports[selector->index].wwn[0] == 0) return 1;
                        info->wwpn = ports[selector->index];
                        return 0;
                      });
  }
  /// One list for every port; `count` is what the library claims, if it is not the true one.
  void provideVPorts(std::vector<HBA_WWN> vports, std::int64_t count = -1) {
    libraries.provide(LRM_VPList, [this, vports, count](HBA_WWN port, RM_VPortList* list) {
      listed.push_back(port.wwn[7]);
      rooms.push_back(list->count);
      const std::uint32_t room = list->count;
      list->count =
          static_cast<std::uint32_t>(count >= 0 ? count : static_cast<std::int64_t>(vports.size()));
      for (std::uint32_t i = 0; i < vports.size() && i < room; ++i) list->entry[i].wwpn = vports[i];
      return room < vports.size() ? 7 : vportStatus;
    });
  }

  Fake_Libraries libraries;
  Log_Capture capture;
  std::vector<RM_STATUS> statuses = {0};
  std::uint32_t told = 0;
  int calls = 0;
  int throwsAt = 0;
  RM_STATUS vportStatus = 0;
  std::vector<int> listed;
  std::vector<std::uint32_t> rooms;
  Property<std::uint16_t> operation{};
  Property<std::uint32_t> result{};
  Property<std::uint32_t> capability{};
  Property<String> wwpn{};
  Property<String> wwnn{};
};

// --- Changing ------------------------------------------------------------------------------------

TEST_F(Wwn_Management, ChangeHandsEverythingOnAndTellsSuccess) {
  libraries.provide(LRM_ChangeWWN, [&](HBA_WWN port, HBA_WWN newPort, HBA_WWN newNode,
                                       std::uint32_t type, std::uint32_t* out) {
    EXPECT_EQ(port.wwn[7], 1);
    EXPECT_EQ(newPort.wwn[7], 2);
    EXPECT_EQ(newNode.wwn[7], 3);
    EXPECT_EQ(type, 1U);
    *out = 6;
    return 0;
  });
  TVX_MethodWrapper::ChangeWWN(name(1), name(2), name(3), 1, operation, result);
  EXPECT_EQ(result.value, 0U);
  EXPECT_FALSE(result.is_null());
  EXPECT_EQ(operation.value, 6);
  EXPECT_THAT(capture.lines(),
              ElementsAre(Logged{4, "ChangeWWN operation initiated"},
                          Logged{2, "New WWNs written successfully"},
                          Logged{2, "Reboot required to activate the new setting"}));
  EXPECT_TRUE(sleeps.empty());
}

TEST_F(Wwn_Management, ChangeTellsWhatHasToFollow) {
  const std::string text =
      "Volatile names will be active until system power-down or HBA power-cycle";
  const std::string reboot = "Reboot required to activate the new setting";
  const std::string reset = "Reset required to activate the new setting";
  const struct {
    std::uint32_t told;
    std::vector<Logged> lines;
  } rows[] = {{5, {{2, reboot}, {2, text}}},
              {6, {{2, reboot}}},
              {7, {{2, reset}, {2, text}}},
              {8, {{2, reset}}}};
  for (const auto& row : rows) {
    capture.forget();
    told = row.told;
    change();
    EXPECT_EQ(operation.value, row.told);
    const std::vector<Logged> lines = capture.lines();
    ASSERT_GE(lines.size(), 2U);
    EXPECT_EQ(std::vector<Logged>(lines.begin() + 2, lines.end()), row.lines) << row.told;
  }
}

TEST_F(Wwn_Management, AnyOtherOperationStatusOfAChangeIsNotTold) {
  for (const std::uint32_t other : {0U, 1U, 4U, 9U, 0x10005U}) {
    told = other;
    change();
    EXPECT_EQ(operation.value, 65535) << other;
    EXPECT_EQ(result.value, 0U);
  }
}

TEST_F(Wwn_Management, AnInvalidNewNameIsRefusedBeforeAnythingIsDone) {
  std::uint8_t invalid = 2;
  libraries.provide(RM_ValidateWwn, [&](HBA_WWN wwn) { return wwn.wwn[7] == invalid ? 5 : 0; });
  change();
  EXPECT_EQ(result.value, 40005U);
  EXPECT_TRUE(capture.has(3, "The supplied 'New WWPN' is not valid"));
  invalid = 3;
  change();
  EXPECT_EQ(result.value, 40005U);
  EXPECT_TRUE(capture.has(3, "The supplied 'New WWNN' is not valid"));
  EXPECT_EQ(calls, 0);
  EXPECT_EQ(operation.value, 65535);
}

TEST_F(Wwn_Management, OnlyStatusFiveMakesANameInvalid) {
  libraries.provide(RM_ValidateWwn, [](HBA_WWN) { return 1; });
  change();
  EXPECT_EQ(result.value, 0U);
  EXPECT_EQ(calls, 1);
}

TEST_F(Wwn_Management, FailuresOfAChange) {
  const struct {
    RM_STATUS status;
    const char* text;
  } rows[] = {{92, "WWN Management is not available on this HBA"},
              {89, "WWN NOT SUPPORTED"},
              {148, nullptr}};
  for (const auto& row : rows) {
    capture.forget();
    statuses = {row.status};
    change();
    EXPECT_EQ(result.value, 40000U + static_cast<std::uint32_t>(row.status));
    std::vector<Logged> expected = {{4, "ChangeWWN operation initiated"}};
    if (row.text) expected.push_back({3, row.text});
    expected.push_back(
        {3, "ChanngeWWN: RM_ChangeWWN call failed with error: " + std::to_string(row.status)});
    EXPECT_EQ(capture.lines(), expected);
  }
  EXPECT_EQ(operation.value, 65535);
}

// --- A busy adapter ------------------------------------------------------------------------------

TEST_F(Wwn_Management, ABusyAdapterIsAskedOnceASecondUntilItIsDone) {
  statuses = {97, 97, 97, 0};
  told = 8;
  change();
  EXPECT_EQ(calls, 4);
  EXPECT_EQ(sleeps, std::vector<std::uint64_t>(3, 1'000'000));
  EXPECT_EQ(result.value, 0U);
  EXPECT_EQ(operation.value, 8);
  EXPECT_EQ(capture.count(5, "Validating new WWNs..."), 1U);
}

TEST_F(Wwn_Management, AnAdapterThatStaysBusyIsGivenUpAfterThreeHundredRepetitions) {
  statuses = {97};
  change();
  EXPECT_EQ(calls, 301);
  EXPECT_EQ(sleeps.size(), 300U);
  EXPECT_EQ(result.value, 40097U);
  EXPECT_TRUE(capture.has(3, "ChanngeWWN: RM_ChangeWWN call failed with error: 97"));
}

TEST_F(Wwn_Management, ABusyAdapterThatFailsIsNotAskedAgain) {
  statuses = {97, 92};
  change();
  EXPECT_EQ(calls, 2);
  EXPECT_EQ(result.value, 40092U);
}

TEST_F(Wwn_Management, AfterAnExceptionTheLastStatusStays) {
  statuses = {97};
  throwsAt = 3;
  change();
  EXPECT_EQ(calls, 3);
  EXPECT_EQ(result.value, 40097U);
  EXPECT_TRUE(capture.has(3, "Error in RM_ChangeWWN"));
  calls = 0;
  throwsAt = 1;
  change();
  EXPECT_EQ(result.value, 40001U);
}

// --- Duplicates ----------------------------------------------------------------------------------

TEST_F(Wwn_Management, ANewNameOfAVirtualPortIsRefusedWithoutAChange) {
  providePorts({name(0x51), name(0x52)});
  provideVPorts({name(0x60), name(2)});
  change();
  EXPECT_EQ(result.value, 91U);
  EXPECT_EQ(operation.value, 1);
  EXPECT_EQ(calls, 0);
  EXPECT_THAT(capture.lines(),
              ElementsAre(Logged{5, "ChangeWWN: Duplication of vport WWPN detected."}));
  // The walk goes on after a hit; each port is asked with room for one, then for two.
  EXPECT_THAT(listed, ElementsAre(0x51, 0x51, 0x52, 0x52));
  EXPECT_THAT(rooms, ElementsAre(1U, 2U, 1U, 2U));
}

TEST_F(Wwn_Management, ANodeNameThatIsAVirtualPortsPortNameIsTheSameKind) {
  providePorts({name(0x51)});
  provideVPorts({name(3)});
  change();
  EXPECT_EQ(result.value, 91U);
  EXPECT_EQ(operation.value, 1);
  EXPECT_TRUE(capture.has(5, "ChangeWWN: Duplication of vport WWPN detected."));
}

TEST_F(Wwn_Management, APortThatWasWalkedIsSkippedAndOneWithoutDataToo) {
  providePorts({name(0x51), HBA_WWN{}, name(0x51), name(0x52)});
  provideVPorts({name(0x60)});
  change();
  EXPECT_THAT(listed, ElementsAre(0x51, 0x52));
  EXPECT_EQ(result.value, 0U);
  EXPECT_EQ(calls, 1);
}

TEST_F(Wwn_Management, WithoutLocalPortsThereIsNothingToWalk) {
  providePorts({});
  provideVPorts({name(2)});
  change();
  EXPECT_TRUE(listed.empty());
  EXPECT_EQ(result.value, 0U);
}

TEST_F(Wwn_Management, OneThousandAndTwentyThreeVirtualPortsAreLookedThroughAndNoMore) {
  providePorts({name(0x51)});
  std::vector<HBA_WWN> vports(1023, name(0x60));
  vports.back() = name(2);
  provideVPorts(vports);
  change();
  EXPECT_EQ(result.value, 91U);
  vports.insert(vports.begin(), name(0x60));
  provideVPorts(vports);
  change();
  EXPECT_EQ(result.value, 0U);
  EXPECT_EQ(calls, 1);
}

TEST_F(Wwn_Management, AVirtualPortListThatFailsOrIsEmptyHoldsNoDuplicate) {
  providePorts({name(0x51)});
  provideVPorts({name(2)}, 0);
  change();
  EXPECT_EQ(result.value, 0U);
  vportStatus = 128;
  provideVPorts({name(2)});
  change();
  EXPECT_EQ(result.value, 0U);
}

TEST_F(Wwn_Management, ACountBeyondTheRoomIsNotReadBeyondIt) {
  providePorts({name(0x51)});
  provideVPorts({name(0x60)}, 1000);  // claims success with more than it was given room for
  change();
  EXPECT_EQ(result.value, 0U);
}

// --- Restoring -----------------------------------------------------------------------------------

TEST_F(Wwn_Management, RestoreTellsWhatHasToFollow) {
  const std::string text =
      "Volatile names will be active until system power-down or HBA power-cycle";
  const std::string done = "WWNs restored successfully";
  const struct {
    std::uint32_t told;
    std::vector<Logged> lines;
  } rows[] = {{1, {{2, "WWNs already active. No Restore needed"}}},
              {5, {{2, done}, {2, "Reboot required to activate the new setting"}, {2, text}}},
              {6, {{2, done}, {2, "Reboot required to activate the new setting"}}},
              {7, {{2, done}, {2, "Reset the HBA to activate the new setting"}, {2, text}}},
              {8, {{2, done}, {2, "Please reset the HBA to activate the new setting"}}}};
  for (const auto& row : rows) {
    capture.forget();
    told = row.told;
    restore();
    EXPECT_EQ(result.value, 0U);
    EXPECT_EQ(operation.value, row.told);
    std::vector<Logged> expected = {{4, "RestoreWWN operation initiated."}};
    expected.insert(expected.end(), row.lines.begin(), row.lines.end());
    EXPECT_EQ(capture.lines(), expected);
  }
}

TEST_F(Wwn_Management, ARestoreThatFailsShowsInTheOperationStatusAlone) {
  statuses = {92};
  told = 5;
  restore();
  EXPECT_EQ(result.value, 0U);
  EXPECT_FALSE(result.is_null());
  EXPECT_EQ(operation.value, 65535);
  EXPECT_THAT(capture.lines(), ElementsAre(Logged{4, "RestoreWWN operation initiated."}));
}

TEST_F(Wwn_Management, ARestoreWaitsForABusyAdapter) {
  statuses = {97, 97, 0};
  told = 1;
  restore();
  EXPECT_EQ(calls, 3);
  EXPECT_EQ(sleeps.size(), 2U);
  EXPECT_EQ(operation.value, 1);
  EXPECT_EQ(capture.count(5, "Restoring WWNs..."), 1U);
  calls = 0;
  statuses = {97};
  operation.set(std::uint16_t{65535});
  restore();
  EXPECT_EQ(calls, 301);
  EXPECT_EQ(operation.value, 65535);
  EXPECT_EQ(result.value, 0U);
}

// --- Reading -------------------------------------------------------------------------------------

TEST_F(Wwn_Management, NamesAreReadInLowerCaseWithColons) {
  libraries.provide(LRM_ReadWWN, [](HBA_WWN wwn, std::uint32_t type, HBA_WWN* port, HBA_WWN* node,
                                    std::uint32_t*) {
    EXPECT_EQ(wwn.wwn[7], 1);
    EXPECT_EQ(type, 1U);
    *port = name(0xEF);
    *node = name(0x02);
    return 0;
  });
  read(1);
  EXPECT_EQ(result.value, 0U);
  EXPECT_FALSE(wwpn.is_null());
  EXPECT_STREQ(wwpn.value.c_str(), "10:00:00:00:00:00:ab:ef");
  EXPECT_STREQ(wwnn.value.c_str(), "10:00:00:00:00:00:ab:02");
  EXPECT_EQ(operation.value, 65535);
  EXPECT_THAT(capture.lines(), ElementsAre(Logged{4, "Non-Volatile WWNs read successfully"},
                                           Logged{5, "WWPN: 10:00:00:00:00:00:ab:ef"},
                                           Logged{5, "WWNN: 10:00:00:00:00:00:ab:02"}));
}

TEST_F(Wwn_Management, WhatIsToldOfEachKindOfNames) {
  const struct {
    std::uint16_t type;
    std::uint32_t told;
    std::uint16_t operation;
    int level;
    const char* text;
  } rows[] = {
      {0, 1, 1, 4, "Volatile WWNs are active"},
      {0, 9, 9, 3, "Volatile WWNs DO NOT EXIST on this adapter"},
      {1, 5, 65535, 4, "Non-Volatile WWNs read successfully"},
      {2, 5, 65535, 4, "Factory Default WWNs read successfully"},
      {3, 3, 3, 4, "Current WWNs: Volatile"},
      {3, 4, 4, 4, "Current WWNs: Non-Volatile"},
      {4, 5, 5, 4, "Configured WWNs: Volatile (Activation required: warm reboot)"},
      {4, 7, 7, 4, "Configured WWNs: Volatile (Activation required: adapter restart)"},
      {4, 6, 6, 4, "Configured WWNs: Non-Volatile (Activation required: warm reboot)"},
      {4, 8, 8, 4, "Configured WWNs: Non-Volatile (Activation required: adapter restart)"},
  };
  for (const auto& row : rows) {
    capture.forget();
    operation.set(std::uint16_t{65535});
    told = row.told;
    read(row.type);
    EXPECT_EQ(result.value, 0U) << row.text;
    EXPECT_EQ(operation.value, row.operation) << row.text;
    EXPECT_THAT(capture.lines(),
                ElementsAre(Logged{row.level, row.text}, Logged{5, "WWPN: 10:00:00:00:00:00:ab:0c"},
                            Logged{5, "WWNN: 10:00:00:00:00:00:ab:0d"}));
  }
}

TEST_F(Wwn_Management, AnOperationStatusWithoutMeaningKeepsTheStartingValue) {
  told = 77;
  for (const std::uint16_t type : std::initializer_list<std::uint16_t>{0, 3, 4}) {
    read(type);
    EXPECT_EQ(operation.value, 65535) << type;
    EXPECT_EQ(result.value, 0U);
  }
}

TEST_F(Wwn_Management, ConfiguredNamesThatDoNotExistAreNoFailure) {
  told = 9;
  read(4);
  EXPECT_EQ(result.value, 0U);
  EXPECT_EQ(operation.value, 9);
  EXPECT_TRUE(wwpn.is_null());
  EXPECT_TRUE(wwnn.is_null());
  EXPECT_THAT(capture.lines(), ElementsAre(Logged{4, "Configured WWNs DO NOT EXIST"}));
}

TEST_F(Wwn_Management, FailuresOfARead) {
  const struct {
    std::uint16_t type;
    RM_STATUS status;
    const char* text;
  } rows[] = {{0, 89, "Volatile WWNs are NOT SUPPORTED on this adapter"},
              {1, 89, "ReadWWN: RM_ReadWWN call failed with error: 89"},
              {0, 92, "WWN Management is NOT AVAILABLE on this adapter"},
              {4, 92, "WWN Management is NOT AVAILABLE on this adapter"},
              {2, 1, "ReadWWN: RM_ReadWWN call failed with error: 1"}};
  for (const auto& row : rows) {
    capture.forget();
    statuses = {row.status};
    read(row.type);
    EXPECT_EQ(result.value, 40000U + static_cast<std::uint32_t>(row.status));
    EXPECT_THAT(capture.lines(), ElementsAre(Logged{3, row.text}));
  }
  EXPECT_TRUE(wwpn.is_null());
  EXPECT_EQ(operation.value, 65535);
}

// --- Capability ----------------------------------------------------------------------------------

TEST_F(Wwn_Management, CapabilityBitsAreLogged) {
  std::uint32_t bits = 0x8000 | 0x1000 | 0x2000 | 8 | 4;
  libraries.provide(LRM_GetWWNCapability, [&](HBA_WWN wwn, std::uint32_t* out) {
    EXPECT_EQ(wwn.wwn[7], 1);
    EXPECT_EQ(*out, 1U);
    *out = bits;
    return 0;
  });
  getCapability();
  EXPECT_EQ(result.value, 0U);
  EXPECT_EQ(capability.value, bits);
  EXPECT_THAT(
      capture.lines(),
      ElementsAre(Logged{4,
                         "Read Only mode: World Wide Name Management is not supported in this "
                         "mode"},
                  Logged{4, "Can change Non-Volatile WWNs"}, Logged{4, "Can change Volatile WWNs"},
                  Logged{4, "Activation requirement: Reboot"},
                  Logged{4, "Activation requirement: Reset HBA"}));
  capture.forget();
  bits = 0xFFFF0000;
  getCapability();
  EXPECT_EQ(capability.value, bits);
  EXPECT_THAT(capture.lines(), ElementsAre(Logged{4, "Cannot change Non-Volatile WWNs"},
                                           Logged{4, "Cannot change Volatile WWNs"}));
}

TEST_F(Wwn_Management, FailuresOfTheCapability) {
  RM_STATUS status = 92;
  libraries.provide(LRM_GetWWNCapability, [&](HBA_WWN, std::uint32_t*) { return status; });
  getCapability();
  EXPECT_EQ(result.value, 40092U);
  EXPECT_TRUE(capability.is_null());
  EXPECT_THAT(
      capture.lines(),
      ElementsAre(Logged{3, "WWN Management is not available on this HBA"},
                  Logged{3, "GetWWNCapability: RM_ReadWWNCapability call failed with error: 92"}));
  capture.forget();
  status = 2;
  getCapability();
  EXPECT_EQ(result.value, 40002U);
  EXPECT_THAT(
      capture.lines(),
      ElementsAre(Logged{3, "GetWWNCapability: RM_ReadWWNCapability call failed with error: 2"}));
}

}  // namespace
}  // namespace cimrt
