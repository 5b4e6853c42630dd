#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cstring>
#include <map>
#include <string>
#include <vector>

#include "access/TVX_MethodWrapper.h"
#include "common/TVX_Memory.h"
#include "support/Fake_Libraries.h"
#include "support/Log_Capture.h"

namespace cimrt {
namespace {

using tvx::test::Fake_Libraries;
using tvx::test::Log_Capture;

constexpr const char* INITIATOR = "1000000000000041";
constexpr const char* TARGET = "5000000000000001";
constexpr std::uint64_t LUN = 0x0001000000000000;

int allocationsLeft = 0;

std::string bytes(std::initializer_list<int> values) {
  std::string text;
  for (const int value : values) text += static_cast<char>(value);
  return text;
}

template <class T>
std::string raw(T value) {
  return {reinterpret_cast<const char*>(&value), sizeof value};
}

class Target_Mapping : public testing::Test {
 protected:
  struct Entry {
    std::uint64_t lun;
    std::uint8_t valid;
    std::uint8_t osLun;
  };

  void SetUp() override {
    provideAttributes();
    provideScsi();
    libraries.provide(LRM_GetLunList, [this](HBA_WWN initiator, HBA_WWN target,
                                             std::uint32_t option, RM_LunList* list) {
      EXPECT_EQ(initiator.wwn[0], 0x10);
      EXPECT_EQ(target.wwn[0], 0x50);
      EXPECT_EQ(option, 0U);
      return giveList(list);
    });
    libraries.load();
  }
  void TearDown() override { tvxSetAllocator(nullptr); }

  void provideAttributes() {
    libraries.provide(LRM_GetLunAttributes,
                      [this](HBA_WWN, HBA_WWN, std::uint64_t lun, void*, std::uint32_t* size) {
                        EXPECT_EQ(lun, LUN);
                        EXPECT_EQ(*size, 4096U);
                        return attributesStatus;
                      });
    libraries.provide(
        RM_GetAttributeValue,
        [this](const void*, std::uint32_t key, std::uint32_t* length, RM_STATUS* status) -> void* {
          EXPECT_EQ(*status, 1);
          const auto found = attributes.find(key);
          *status = found != attributes.end() ? 0 : 0x2A;
          if (found == attributes.end()) return nullptr;
          *length = static_cast<std::uint32_t>(found->second.size());
          return found->second.data();
        });
  }

  void provideScsi() {
    libraries.provide(LRM_ScsiInquiry,
                      [this](HBA_WWN, HBA_WWN, std::uint64_t, void* data, std::uint32_t size,
                             void* sense, std::uint32_t senseSize) {
                        EXPECT_EQ(size, 256U);
                        EXPECT_EQ(senseSize, 255U);
                        ++inquiries;
                        static_cast<std::uint8_t*>(data)[0] = inquiryType;
                        static_cast<std::uint8_t*>(sense)[12] = senseByte;
                        return inquiries < inquirySucceedsAt ? inquiryStatus : 0;
                      });
    libraries.provide(LRM_ScsiReadCapacity, [this](HBA_WWN, HBA_WWN, std::uint64_t, void* data,
                                                   std::uint32_t size, void*, std::uint32_t) {
      EXPECT_EQ(size, 32U);
      ++capacities;
      std::memcpy(data, scsiCapacity.data(), scsiCapacity.size());
      return capacityStatus;
    });
  }

  RM_STATUS giveList(RM_LunList* list) {
    listCounts.push_back(list->count);
    if (listStatus != 0) return listStatus;
    const auto needed = static_cast<std::uint32_t>(entries.size());
    const bool fits = list->count >= needed;
    const std::uint32_t written = fits ? needed : 0;
    for (std::uint32_t i = 0; i < written; ++i) {
      std::uint8_t* const at = reinterpret_cast<std::uint8_t*>(list) + 8 + 12 * i;
      std::memcpy(at, &entries[i].lun, 8);
      at[10] = entries[i].valid;
      at[11] = entries[i].osLun;
    }
    list->count = claimedCount != 0 && fits ? claimedCount : needed;
    return fits ? 0 : 7;
  }

  RM_STATUS run() {
    return TVX_MethodWrapper::tvxcimGetTargetMapping(INITIATOR, TARGET, LUN, &info);
  }

  Fake_Libraries libraries;
  Log_Capture capture;
  ExtendedLunInfo info;
  RM_STATUS attributesStatus = 0;
  std::map<std::uint32_t, std::string> attributes;
  int inquiries = 0;
  int inquirySucceedsAt = 1;
  RM_STATUS inquiryStatus = 187;
  std::uint8_t inquiryType = 0;
  std::uint8_t senseByte = 0;
  int capacities = 0;
  RM_STATUS capacityStatus = 0;
  std::string scsiCapacity = bytes({0, 0, 0x10, 0, 0, 0, 2, 0});
  RM_STATUS listStatus = 0;
  std::vector<Entry> entries;
  std::uint32_t claimedCount = 0;
  std::vector<std::uint32_t> listCounts;
};

// ---- Names ----

TEST_F(Target_Mapping, NeedsBothNames) {
  EXPECT_EQ(TVX_MethodWrapper::tvxcimGetTargetMapping(nullptr, TARGET, LUN, &info), 1);
  EXPECT_TRUE(capture.has(3, "Id2HBAName failed"));
  EXPECT_EQ(TVX_MethodWrapper::tvxcimGetTargetMapping(INITIATOR, "short", LUN, &info), 1);
  EXPECT_TRUE(capture.has(3, "str2HBAName failed"));
  EXPECT_EQ(TVX_MethodWrapper::tvxcimGetTargetMapping(INITIATOR, TARGET, LUN, nullptr), 4);
}

TEST_F(Target_Mapping, NeedsMemoryForTheAttributes) {
  allocationsLeft = 0;
  tvxSetAllocator([](std::size_t) -> void* { return nullptr; });
  EXPECT_EQ(run(), 1);
  EXPECT_TRUE(capture.has(1, "Could not allocate memory for Lun Attribute"));
}

// ---- By attributes ----

TEST_F(Target_Mapping, TakesCapacityAndNameFromTheAttributes) {
  attributes = {{1537, bytes({0x00, 1, 2})},
                {1539, "/dev/sda"},
                {1540, raw(std::uint32_t{512})},
                {1541, raw(std::uint64_t{0x1'0000'0002})}};
  EXPECT_EQ(run(), 0);
  EXPECT_EQ(info.BlockSize, 512U);
  EXPECT_EQ(info.MaxLba, 2);
  EXPECT_EQ(info.TotalBytes, 512U * 0x1'0000'0002);
  EXPECT_STREQ(info.DeviceName, "/dev/sda");
  EXPECT_EQ(info.OsLunByte, 0);
  EXPECT_EQ(inquiries, 0);
  EXPECT_TRUE(capture.has(5, " Lun Device Name: /dev/sda"));
  EXPECT_TRUE(capture.has(5, "Populate ExtendedLunInfo structure.."));
  EXPECT_EQ(capture.lines().back().text, "Clean Exit");
}

TEST_F(Target_Mapping, TheUpperHalfOfTheAddressIsCutFromMaxLba) {
  attributes = {{1537, bytes({0})},
                {1540, raw(std::uint32_t{1})},
                {1541, raw(std::uint64_t{0xFFFF'FFFF'FFFF})}};
  EXPECT_EQ(run(), 0);
  EXPECT_EQ(info.MaxLba, -1);
  EXPECT_EQ(info.TotalBytes, 0xFFFF'FFFF'FFFFU);
}

TEST_F(Target_Mapping, OnlyADiskHasACapacity) {
  attributes = {{1537, bytes({0x01})},
                {1540, raw(std::uint32_t{512})},
                {1541, raw(std::uint64_t{9})},
                {1539, "tape"}};
  EXPECT_EQ(run(), 0);
  EXPECT_EQ(info.BlockSize, 0U);
  EXPECT_STREQ(info.DeviceName, "tape");
  attributes[1537] = bytes({0xE0});  // the upper three bits do not count
  EXPECT_EQ(run(), 0);
  EXPECT_EQ(info.BlockSize, 512U);
}

TEST_F(Target_Mapping, MissingInquiryDataAreLogged) {
  attributes = {{1540, raw(std::uint32_t{512})}, {1541, raw(std::uint64_t{9})}};
  EXPECT_EQ(run(), 0);
  EXPECT_EQ(info.BlockSize, 0U);
  EXPECT_TRUE(capture.has(3,
                          "ERROR: tvxcimGetTargetMapping: RM_GetAttributeValue call failed for "
                          "scsi inquiry; ( 2a )"));
  EXPECT_TRUE(capture.has(5, " Lun Device Name: Not Available"));
  EXPECT_STREQ(info.DeviceName, "");
}

TEST_F(Target_Mapping, ReadCapacityDataStandIn) {
  attributes = {{1537, bytes({0})},
                {1540, raw(std::uint32_t{4096})},
                {1538, bytes({0x00, 0x01, 0x02, 0x03, 0, 0, 2, 0})}};
  EXPECT_EQ(run(), 0);
  EXPECT_EQ(info.MaxLba, 0x00010203);
  EXPECT_EQ(info.BlockSize, 512U);
}

TEST_F(Target_Mapping, ReadCapacityDataNeedEightBytes) {
  attributes = {{1537, bytes({0})}, {1538, bytes({1, 1, 1, 1, 0, 0, 2})}};
  EXPECT_EQ(run(), 0);
  EXPECT_EQ(info.BlockSize, 0U);
  EXPECT_EQ(info.MaxLba, 0);
}

TEST_F(Target_Mapping, TheLongAddressStandsBehindAnOverflowedOne) {
  const std::string head = bytes({0xFF, 0xFF, 0xFF, 0xFF, 0, 0, 2, 0});
  const std::string tail = bytes({0, 0, 0, 2, 0, 0, 0, 5});
  attributes = {{1537, bytes({0})}, {1538, head + tail}};
  EXPECT_EQ(run(), 0);
  EXPECT_EQ(info.MaxLba, 5);
  EXPECT_EQ(info.TotalBytes, 512U * 0x2'0000'0005);
  attributes[1538] = head + std::string(8, '\0');
  EXPECT_EQ(run(), 0);
  EXPECT_EQ(info.TotalBytes, std::uint64_t{512} * 0xFFFFFFFF);
  attributes[1538] = head + tail.substr(0, 7);
  EXPECT_EQ(run(), 0);
  EXPECT_EQ(info.TotalBytes, std::uint64_t{512} * 0xFFFFFFFF);
}

TEST_F(Target_Mapping, ShortNumberAttributesDoNotCount) {
  attributes = {{1537, bytes({0})}, {1540, bytes({0, 2})}, {1541, raw(std::uint64_t{9})}};
  EXPECT_EQ(run(), 0);
  EXPECT_EQ(info.BlockSize, 0U);
}

TEST_F(Target_Mapping, TheDeviceNameIsCutToItsField) {
  attributes = {{1537, bytes({0})}, {1539, std::string(1000, 'n')}};
  EXPECT_EQ(run(), 0);
  EXPECT_EQ(std::string(info.DeviceName), std::string(255, 'n'));
  attributes[1539] = "exact";  // no NUL within the length
  EXPECT_EQ(run(), 0);
  EXPECT_STREQ(info.DeviceName, "exact");
}

// ---- By SCSI commands ----

TEST_F(Target_Mapping, ScsiCommandsStandInForTheAttributes) {
  attributesStatus = 3;
  EXPECT_EQ(run(), 0);
  EXPECT_EQ(inquiries, 1);
  EXPECT_EQ(capacities, 1);
  EXPECT_EQ(info.MaxLba, 0x1000);
  EXPECT_EQ(info.BlockSize, 512U);
  EXPECT_STREQ(info.DeviceName, "");
}

TEST_F(Target_Mapping, AFailedInquiryIsRepeatedOnce) {
  attributesStatus = 3;
  inquirySucceedsAt = 2;
  EXPECT_EQ(run(), 0);
  EXPECT_EQ(inquiries, 2);
  EXPECT_EQ(info.BlockSize, 512U);
}

TEST_F(Target_Mapping, AnythingButADiskEndsTheScsiPath) {
  attributesStatus = 3;
  inquiryType = 1;
  EXPECT_EQ(run(), 0);
  EXPECT_EQ(capacities, 0);
  EXPECT_EQ(info.BlockSize, 0U);
}

TEST_F(Target_Mapping, AFailedReadCapacityGivesZero) {
  attributesStatus = 3;
  capacityStatus = 9;
  EXPECT_EQ(run(), 0);
  EXPECT_EQ(info.BlockSize, 0U);
  EXPECT_EQ(info.MaxLba, 0);
}

TEST_F(Target_Mapping, ACheckConditionIsLoggedWithItsCode) {
  attributesStatus = 3;
  inquirySucceedsAt = 99;
  senseByte = 0x29;
  EXPECT_EQ(run(), 0);
  EXPECT_EQ(inquiries, 2);
  EXPECT_TRUE(capture.has(3,
                          "ERROR: tvxcimGetTargetMapping: RM_ScsiInquiry call failed with SCSI "
                          "Check Condition: Sense Key = 0x 29"));
}

TEST_F(Target_Mapping, OneCodeOfACheckConditionIsSilent) {
  attributesStatus = 3;
  inquirySucceedsAt = 99;
  senseByte = 0x20;
  EXPECT_EQ(run(), 0);
  for (const auto& line : capture.lines()) EXPECT_EQ(line.level, 5) << line.text;
}

TEST_F(Target_Mapping, AnotherInquiryFailureIsLoggedWithItsStatus) {
  attributesStatus = 3;
  inquirySucceedsAt = 99;
  inquiryStatus = 64;
  EXPECT_EQ(run(), 0);
  EXPECT_TRUE(capture.has(3, "ERROR: tvxcimGetTargetMapping: RM_ScsiInquiry call failed ( 64 )"));
}

// ---- The system's number ----

TEST_F(Target_Mapping, TheSystemsNumberIsMarked) {
  entries = {{LUN, 1, 0x05}};
  EXPECT_EQ(run(), 0);
  EXPECT_EQ(info.OsLunByte, 0x85);
  EXPECT_THAT(listCounts, testing::ElementsAre(1U));
}

TEST_F(Target_Mapping, AnEntryWithoutTheMarkGivesZero) {
  entries = {{LUN, 2, 0x05}};
  EXPECT_EQ(run(), 0);
  EXPECT_EQ(info.OsLunByte, 0);
  entries = {{LUN + 1, 1, 0x05}};
  EXPECT_EQ(run(), 0);
  EXPECT_EQ(info.OsLunByte, 0);
}

TEST_F(Target_Mapping, ALongerListIsReadAgain) {
  for (std::uint64_t i = 0; i < 10; ++i) {
    entries.push_back({LUN - 9 + i, 1, static_cast<std::uint8_t>(i)});
  }
  EXPECT_EQ(run(), 0);
  EXPECT_THAT(listCounts, testing::ElementsAre(1U, 10U));
  EXPECT_EQ(info.OsLunByte, 0x89);
}

TEST_F(Target_Mapping, EntriesBehindTheTwoHundredAndFiftySixthAreNotReached) {
  for (std::uint64_t i = 0; i < 300; ++i) entries.push_back({i + 1, 1, 1});
  entries[255].lun = LUN;
  EXPECT_EQ(run(), 0);
  EXPECT_EQ(info.OsLunByte, 0x81);
  std::swap(entries[255], entries[256]);
  EXPECT_EQ(run(), 0);
  EXPECT_EQ(info.OsLunByte, 0);
}

TEST_F(Target_Mapping, ACountBeyondTheBufferIsNotBelieved) {
  entries = {{LUN + 1, 1, 5}};
  claimedCount = 0xFFFFFFFF;
  EXPECT_EQ(run(), 0);
  EXPECT_EQ(info.OsLunByte, 0);
}

TEST_F(Target_Mapping, AFailedListIsLogged) {
  listStatus = 3;
  EXPECT_EQ(run(), 0);
  EXPECT_TRUE(capture.has(3, "ERROR: RM_GetLunList: RM_GetLunList call failed ( 3 )"));
  listStatus = 7;  // and stays so
  listCounts.clear();
  EXPECT_EQ(run(), 0);
  EXPECT_EQ(listCounts.size(), 2U);
  EXPECT_TRUE(capture.has(3, "ERROR: RM_GetLunList: RM_GetLunList call failed ( 7 )"));
}

TEST_F(Target_Mapping, WithoutMemoryForTheListTheRestStands) {
  attributes = {{1537, bytes({0})}, {1539, "name"}};
  allocationsLeft = 1;
  tvxSetAllocator([](std::size_t size) -> void* {
    return allocationsLeft-- > 0 ? std::calloc(1, size) : nullptr;
  });
  EXPECT_EQ(run(), 0);
  EXPECT_TRUE(capture.has(1, "ERROR: Unable to allocate buffer"));
  EXPECT_STREQ(info.DeviceName, "name");
  EXPECT_EQ(info.OsLunByte, 0);
}

TEST_F(Target_Mapping, WithoutALibraryEverythingIsZero) {
  UnloadRuntimeLibraries();
  for (const char* name : {"LRM_GetLunAttributes", "RM_GetAttributeValue", "LRM_ScsiInquiry",
                           "LRM_ScsiReadCapacity", "LRM_GetLunList"}) {
    libraries.remove(name);
  }
  LoadRuntimeLibraries();
  info.BlockSize = 77;
  EXPECT_EQ(run(), 0);
  EXPECT_EQ(info.BlockSize, 0U);
  EXPECT_EQ(info.OsLunByte, 0);
}

}  // namespace
}  // namespace cimrt
