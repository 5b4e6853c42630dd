#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cstring>
#include <string>
#include <vector>

#include "access/TVX_MethodWrapper.h"
#include "common/TVX_Memory.h"
#include "support/Fake_Libraries.h"
#include "support/Log_Capture.h"

namespace cimrt {
namespace {

using testing::ElementsAre;
using testing::IsSupersetOf;
using tvx::test::Fake_Libraries;
using tvx::test::Log_Capture;
using tvx::test::Logged;

const HBA_WWN WWN = {{0x10, 0, 0, 0, 0, 0, 0, 0x41}};

/// How many allocations succeed from now on.
int allocationsLeft = 0;

class Wrapper : public testing::Test {
 protected:
  void SetUp() override { libraries.load(); }
  void TearDown() override { tvxSetAllocator(nullptr); }

  /// Makes the allocation after `count` more fail.
  static void failAllocationAfter(int count) {
    allocationsLeft = count;
    tvxSetAllocator([](std::size_t size) -> void* {
      return allocationsLeft-- > 0 ? std::calloc(1, size) : nullptr;
    });
  }
  void provideLocal(RM_STATUS status, std::uint32_t flag) {
    libraries.provide(RM_IsLocalHBA, [=](HBA_WWN, std::uint32_t* local) {
      EXPECT_EQ(*local, 0U);
      *local = flag;
      return status;
    });
  }

  Fake_Libraries libraries;
  Log_Capture capture;
};

// ---- Checks ----

TEST_F(Wrapper, ALocalPortIsValid) {
  provideLocal(0, 1);
  EXPECT_EQ(TVX_MethodWrapper::Validatewwpn(&WWN), 0);
  EXPECT_THAT(capture.lines(), ElementsAre(Logged{5, "Entering TVX_MethodWrapper::Validatewwpn()"},
                                           Logged{5, "RM_IsLocalHBA: status=0"}));
}

TEST_F(Wrapper, AnyOtherPortIsNot) {
  provideLocal(0, 0);
  EXPECT_EQ(TVX_MethodWrapper::Validatewwpn(&WWN), 1);
  provideLocal(5, 1);
  EXPECT_EQ(TVX_MethodWrapper::Validatewwpn(&WWN), 1);
  EXPECT_TRUE(capture.has(5, "RM_IsLocalHBA: status=5"));
  EXPECT_EQ(capture.count(3, "HBA IS NOT LOCAL"), 2U);
  EXPECT_EQ(TVX_MethodWrapper::Validatewwpn(nullptr), 1);
}

TEST_F(Wrapper, WithoutTheEntryPointNoPortIsLocal) {
  EXPECT_EQ(TVX_MethodWrapper::Validatewwpn(&WWN), 1);
  EXPECT_TRUE(capture.has(5, "RM_IsLocalHBA: status=1"));
}

TEST_F(Wrapper, AConvergedPortHasTheFeature) {
  provideLocal(0, 1);
  std::uint32_t value = 1;
  RM_STATUS status = 0;
  libraries.provide(LRM_GetHBAFeature, [&](HBA_WWN, std::uint32_t id, std::uint32_t* out) {
    EXPECT_EQ(id, 201U);
    *out = value;
    return status;
  });
  EXPECT_EQ(TVX_MethodWrapper::IsCorvanCNA(&WWN), 1);
  EXPECT_TRUE(capture.has(5, "TVX_MethodWrapper::IsCorvanCNA"));
  EXPECT_TRUE(capture.has(5, "Corvan CNA Port "));
  capture.forget();
  value = 2;
  EXPECT_EQ(TVX_MethodWrapper::IsCorvanCNA(&WWN), 0);
  value = 1;
  status = 4;
  EXPECT_EQ(TVX_MethodWrapper::IsCorvanCNA(&WWN), 0);
  EXPECT_FALSE(capture.has(5, "Corvan CNA Port "));
}

TEST_F(Wrapper, AForeignPortIsNotAskedForTheFeature) {
  provideLocal(0, 0);
  libraries.provide(LRM_GetHBAFeature, [](HBA_WWN, std::uint32_t, std::uint32_t*) {
    ADD_FAILURE();
    return 0;
  });
  EXPECT_EQ(TVX_MethodWrapper::IsCorvanCNA(&WWN), 0);
  EXPECT_TRUE(capture.has(5, "INVALID wwpn"));
}

// ---- Status printer ----

TEST_F(Wrapper, AStatusIsLoggedWithItsText) {
  libraries.provide(RM_StatusString, [](RM_STATUS status, char* text, std::uint32_t size) {
    EXPECT_EQ(size, 256U);
    std::snprintf(text, size, "text of %d", status);
    return 0;
  });
  TVX_MethodWrapper::StatusString(247);
  EXPECT_THAT(capture.lines(), ElementsAre(Logged{5, "Status: <247>:text of 247"}));
}

TEST_F(Wrapper, AStatusWithoutTextIsLoggedAlone) {
  TVX_MethodWrapper::StatusString(3);  // no such entry point
  libraries.provide(RM_StatusString, [](RM_STATUS, char*, std::uint32_t) { return 0; });
  TVX_MethodWrapper::StatusString(4);
  EXPECT_THAT(capture.lines(), ElementsAre(Logged{5, "Status: <3>"}, Logged{5, "Status: <4>"}));
}

TEST_F(Wrapper, AStatusTextWithoutEndIsBounded) {
  libraries.provide(RM_StatusString, [](RM_STATUS, char* text, std::uint32_t size) {
    std::memset(text, 'x', size);
    return 0;
  });
  TVX_MethodWrapper::StatusString(1);
  EXPECT_TRUE(capture.has(5, "Status: <1>:" + std::string(255, 'x')));
}

// ---- Versions of the library ----

TEST_F(Wrapper, GivesTheLibrarysVersion) {
  libraries.provide(RM_MiliVersion, [](char* text, std::uint32_t size) {
    EXPECT_EQ(size, 64U);
    std::strcpy(text, "10.2.107");
    return 0;
  });
  char version[64];
  std::memset(version, '?', sizeof version);
  EXPECT_EQ(TVX_MethodWrapper::GetMILILibVersion(version), 0);
  EXPECT_STREQ(version, "10.2.107");
  EXPECT_EQ(version[63], '\0');  // all 64 bytes are copied
  EXPECT_TRUE(capture.has(5, "MILILibVersion: 10.2.107"));
}

TEST_F(Wrapper, AVersionThatFillsItsFieldIsBounded) {
  libraries.provide(RM_MiliVersion, [](char* text, std::uint32_t size) {
    std::memset(text, 'v', size);
    return 0;
  });
  char version[65] = {};
  EXPECT_EQ(TVX_MethodWrapper::GetMILILibVersion(version), 0);
  EXPECT_EQ(std::string(version), std::string(64, 'v'));
  EXPECT_TRUE(capture.has(5, "MILILibVersion: " + std::string(64, 'v')));
}

TEST_F(Wrapper, AVersionThatIsTooLongIsTriedTwiceWithTheSameRoom) {
  int calls = 0;
  libraries.provide(RM_MiliVersion, [&](char*, std::uint32_t size) {
    EXPECT_EQ(size, 64U);
    ++calls;
    return 255;
  });
  char version[64];
  EXPECT_EQ(TVX_MethodWrapper::GetMILILibVersion(version), 255);
  EXPECT_EQ(calls, 2);
  EXPECT_TRUE(capture.has(5, "ERROR: Failed to get MILILibVersion, returned with code 255"));
}

TEST_F(Wrapper, AnotherFailureIsNotRepeated) {
  int calls = 0;
  libraries.provide(RM_MiliVersion, [&](char*, std::uint32_t) {
    ++calls;
    return 6;
  });
  char version[64];
  EXPECT_EQ(TVX_MethodWrapper::GetMILILibVersion(version), 6);
  EXPECT_EQ(calls, 1);
}

TEST_F(Wrapper, NoVersionWithoutOutputOrMemory) {
  EXPECT_EQ(TVX_MethodWrapper::GetMILILibVersion(nullptr), 4);
  EXPECT_EQ(TVX_MethodWrapper::GetLibraryVersion(1, nullptr), 4);
  EXPECT_EQ(capture.count(5, "Invalid Output pointer"), 2U);
  failAllocationAfter(0);
  char version[64];
  EXPECT_EQ(TVX_MethodWrapper::GetMILILibVersion(version), 8);
  EXPECT_TRUE(capture.has(3, "Unable to allocate the memory for pMILILibVerBuf"));
  EXPECT_EQ(TVX_MethodWrapper::GetLibraryVersion(1, version), 8);
  EXPECT_TRUE(capture.has(3, "Unable to allocate the memory for pLibVerBuf"));
}

TEST_F(Wrapper, ALibraryVersionIsReadAgainWithTheRoomItNeeds) {
  std::vector<std::uint32_t> sizes;
  libraries.provide(RM_GetVersion, [&](int selector, char* text, std::uint32_t* size) {
    EXPECT_EQ(selector, 3);
    sizes.push_back(*size);
    if (*size < 100) {
      *size = 100;
      return 255;
    }
    std::memset(text, 'v', 99);
    return 0;
  });
  char version[128] = {};
  EXPECT_EQ(TVX_MethodWrapper::GetLibraryVersion(3, version, sizeof version), 0);
  EXPECT_THAT(sizes, ElementsAre(64U, 100U));
  EXPECT_EQ(std::string(version), std::string(99, 'v'));
  EXPECT_TRUE(capture.has(5, "MILILibVersion: " + std::string(99, 'v')));
}

TEST_F(Wrapper, ALibraryVersionIsCutToTheCallersRoom) {
  libraries.provide(RM_GetVersion, [&](int, char* text, std::uint32_t* size) {
    std::memset(text, 'v', 64);
    *size = 0xFFFFFFFF;  // more than it was given
    return 0;
  });
  char version[17];
  std::memset(version, '?', sizeof version);
  EXPECT_EQ(TVX_MethodWrapper::GetLibraryVersion(3, version, 16), 0);
  EXPECT_EQ(std::string(version, 17), std::string(16, 'v') + "?");
}

TEST_F(Wrapper, ALibraryVersionFailureIsLogged) {
  libraries.provide(RM_GetVersion, [](int, char*, std::uint32_t*) { return 9; });
  char version[64];
  EXPECT_EQ(TVX_MethodWrapper::GetLibraryVersion(3, version), 9);
  EXPECT_TRUE(capture.has(5, "ERROR: Failed to get MILILibVersion, returned with code 9"));
}

// ---- Pass-through ----

TEST_F(Wrapper, TraceLevelAndQosPassThrough) {
  libraries.provide(LRM_SetDebugTraces, [](int a, int b) { return 10 * a + b; });
  EXPECT_EQ(TVX_MethodWrapper::SetMILITraceLevel(4, 2), 42);
  libraries.provide(LRM_GetQoS, [](HBA_WWN wwpn, void* info) {
    *static_cast<int*>(info) = wwpn.wwn[0];
    return 0;
  });
  int info = 0;
  EXPECT_EQ(TVX_MethodWrapper::GetQosInfo(&WWN, &info), 0);
  EXPECT_EQ(info, 0x10);
  EXPECT_EQ(TVX_MethodWrapper::GetQosInfo(&WWN, nullptr), 4);
}

TEST_F(Wrapper, AParameterIsHandedOnWithItsControlWord) {
  provideLocal(0, 1);
  std::string text;
  std::uint32_t word = 99;
  libraries.provide(LRM_SetDriverParam, [&](HBA_WWN wwpn, const char* given, std::uint32_t bits) {
    EXPECT_EQ(std::memcmp(&wwpn, &WWN, sizeof wwpn), 0);
    text = given;
    word = bits;
    return 0;
  });
  for (const std::uint32_t cw1 : {0U, 1U})
    for (const std::uint32_t cw2 : {0U, 1U}) {
      EXPECT_EQ(TVX_MethodWrapper::tvxcimSetDriverParam("41", &WWN, cw1, cw2, "depth", "64"), 0);
      EXPECT_EQ(text, "depth=64");
      EXPECT_EQ(word, 2 * cw1 + cw2);
    }
}

TEST_F(Wrapper, ParametersAreAskedForWithRoomForFiftyTwo) {
  std::vector<std::uint32_t> told;
  const auto answer = [&](HBA_WWN wwpn, RM_DriverParam* params, std::uint32_t* count) {
    EXPECT_EQ(std::memcmp(&wwpn, &WWN, sizeof wwpn), 0);
    EXPECT_NE(params, nullptr);
    told.push_back(*count);
    *count = told.size() == 1 ? 60 : 3;
    return told.size() == 1 ? 7 : 0;
  };
  libraries.provide(LRM_GetDriverParams, answer);
  TVX_Driver_Params params;
  EXPECT_EQ(TVX_MethodWrapper::ReadDriverParams(WWN, TVX_Driver_Scope::LOCAL, &params), 0);
  EXPECT_THAT(told, ElementsAre(52U, 60U));
  EXPECT_EQ(params.count, 3U);
}

TEST_F(Wrapper, AUnitsStateIsHandedOnWithItsThreeNames) {
  std::vector<std::uint64_t> given;
  libraries.provide(LRM_SetOASLunState,
                    [&](HBA_WWN initiator, HBA_WWN port, HBA_WWN target, std::uint64_t lun,
                        std::uint8_t state, std::uint32_t option) {
                      given = {initiator.wwn[7], port.wwn[7], target.wwn[7], lun, state, option};
                      return 0;
                    });
  EXPECT_EQ(TVX_MethodWrapper::SetOASLunState("1000000000000001", "1000000000000002",
                                              "1000000000000003", "17", 1, 0),
            0);
  EXPECT_THAT(given, ElementsAre(1, 2, 3, 17, 1, 0));
  EXPECT_EQ(TVX_MethodWrapper::SetOASLunState("1000000000000001", "1000000000000002",
                                              "1000000000000003", "255", 0, 1),
            0);
  EXPECT_THAT(given, ElementsAre(1, 2, 3, 255, 0, 1));
}

TEST_F(Wrapper, ListOfUnitsIsAskedForWithRoomForOne) {
  std::vector<std::uint64_t> given;
  libraries.provide(LRM_GetOASLunList, [&](HBA_WWN initiator, HBA_WWN port, HBA_WWN target,
                                           std::uint32_t option, RM_OASLunList* list) {
    for (const std::uint64_t value :
         {std::uint64_t{initiator.wwn[7]}, std::uint64_t{port.wwn[7]}, std::uint64_t{target.wwn[7]},
          std::uint64_t{option}, std::uint64_t{list->count}})
      given.push_back(value);
    const bool first = list->count == 1;
    list->count = 2;
    return first ? 7 : 0;
  });
  TVX_Block list;
  EXPECT_EQ(TVX_MethodWrapper::GetOASLunList("1000000000000001", "1000000000000002",
                                             "1000000000000003", 1, &list),
            0);
  EXPECT_THAT(given, ElementsAre(1, 2, 3, 1, 1, 1, 2, 3, 1, 2));
}

TEST_F(Wrapper, FeaturesAreLoggedEvery32Bytes) {
  libraries.provide(LRM_GetHBAFeatureList, [](HBA_WWN, std::uint32_t size, std::uint8_t* out) {
    EXPECT_EQ(size, 512U);
    for (std::uint32_t i = 0; i < size; ++i) out[i] = static_cast<std::uint8_t>(i / 32);
    return 0;
  });
  std::uint8_t features[512];
  EXPECT_EQ(TVX_MethodWrapper::GetHBAFeatureList(&WWN, features), 0);
  EXPECT_EQ(capture.lines().size(), 16U);
  EXPECT_EQ(capture.lines().front().text, "TVX_MethodWrapper::Features: 0->0");
  EXPECT_EQ(capture.lines().back().text, "TVX_MethodWrapper::Features: 480->15");
}

TEST_F(Wrapper, FeaturesAreLoggedAfterAFailureToo) {
  std::uint8_t features[512] = {};
  EXPECT_EQ(TVX_MethodWrapper::GetHBAFeatureList(&WWN, features), 1);
  EXPECT_THAT(capture.lines(),
              IsSupersetOf({Logged{5, "Status: <1>"},
                            Logged{5, "Failed to get the HBA List, exited with the error code 1"},
                            Logged{5, "TVX_MethodWrapper::Features: 480->0"}}));
  EXPECT_EQ(TVX_MethodWrapper::GetHBAFeatureList(&WWN, nullptr), 4);
  EXPECT_TRUE(capture.has(5, "Invalid output pointer"));
}

// ---- A target's operating system ----

class Target_Os : public Wrapper {
 protected:
  void SetUp() override {
    Wrapper::SetUp();
    libraries.provide(LRM_GetServerAttributes, [this](HBA_WWN name, void*, std::uint32_t* size) {
      EXPECT_EQ(name.wwn[0], 0x10);
      EXPECT_EQ(*size, 784U);
      return serverStatus;
    });
    libraries.provide(RM_GetAttributeValue, [this](const void*, std::uint32_t key,
                                                   std::uint32_t* length, RM_STATUS* status) {
      EXPECT_EQ(key, 264U);
      EXPECT_EQ(*status, 1);
      *length = static_cast<std::uint32_t>(text.size());
      *status = attributeStatus;
      return isNull ? nullptr : static_cast<void*>(text.data());
    });
    std::memset(out, '?', sizeof out);
  }
  RM_STATUS ask(const char* name = "1000000000000041") {
    return TVX_MethodWrapper::getTargetOS_info(name, out);
  }

  RM_STATUS serverStatus = 0;
  RM_STATUS attributeStatus = 0;
  bool isNull = false;
  std::string text = "Linux 6.1";
  char out[41] = {};
};

TEST_F(Target_Os, IsCopied) {
  EXPECT_EQ(ask(), 0);
  EXPECT_STREQ(out, "Linux 6.1");
}

TEST_F(Target_Os, IsAtMostFortyBytes) {
  text.assign(100, 'o');
  EXPECT_EQ(ask(), 0);
  EXPECT_EQ(std::string(out, 41), std::string(40, 'o') + "?");
}

TEST_F(Target_Os, NeedsAName) {
  EXPECT_EQ(ask(nullptr), 1);
  EXPECT_TRUE(capture.has(3, "Invalid macAddr passed"));
  EXPECT_EQ(ask("00-00-00"), 1);
  EXPECT_TRUE(capture.has(3, "INVALID HBA Name"));
  EXPECT_EQ(TVX_MethodWrapper::getTargetOS_info("1000000000000041", nullptr), 4);
}

TEST_F(Target_Os, FailsWithoutMemory) {
  failAllocationAfter(0);
  EXPECT_EQ(ask(), 8);
  EXPECT_TRUE(
      capture.has(3, "ERROR: TVX_MethodWrapper::getTargetOS_info: Unable to allocate buffer"));
}

TEST_F(Target_Os, FailsWithTheLibrary) {
  serverStatus = 12;
  EXPECT_EQ(ask(), 12);
  EXPECT_TRUE(capture.has(3, "RM_GetServerAttributes failed with 12"));
}

TEST_F(Target_Os, FailsWithoutTheAttribute) {
  attributeStatus = 12;
  EXPECT_EQ(ask(), 1);
  EXPECT_TRUE(capture.has(
      3, "ERROR: TVX_MethodWrapper::getTargetOS_info:Unable to retrieve attribute value"));
}

TEST_F(Target_Os, AMissingReaderIsAFailedReadAndNoAssertion) {
  UnloadRuntimeLibraries();
  libraries.remove("RM_GetAttributeValue");
  LoadRuntimeLibraries();
  EXPECT_EQ(ask(), 1);
}

TEST_F(Target_Os, SuccessWithoutAValueIsAnAssertion) {
  GTEST_FLAG_SET(death_test_style, "threadsafe");
  isNull = true;
  EXPECT_DEATH(ask(), "assert: \"NULL check on \" && attr");
}

// ---- List of distinct names ----

class Wwpn_List : public Wrapper {
 protected:
  void TearDown() override {
    Wrapper::TearDown();
    TVX_MethodWrapper::freeWWPNList(&list, &count);
  }
  int add(std::uint8_t last) {
    const HBA_WWN wwn = {{0x10, 0, 0, 0, 0, 0, 0, last}};
    return TVX_MethodWrapper::isDuplicateEntryInWWPNList(&wwn, &list, &count);
  }
  HBA_WWN** list = nullptr;
  int count = 0;
};

TEST_F(Wwpn_List, RemembersDistinctNames) {
  EXPECT_EQ(add(1), 0);
  EXPECT_EQ(add(2), 0);
  EXPECT_EQ(add(1), 1);
  EXPECT_EQ(add(3), 0);
  EXPECT_EQ(add(3), 1);
  ASSERT_EQ(count, 3);
  EXPECT_EQ(list[2]->wwn[7], 3);
  TVX_MethodWrapper::freeWWPNList(&list, &count);
  EXPECT_EQ(list, nullptr);
  EXPECT_EQ(count, 0);
}

TEST_F(Wwpn_List, IsDroppedWithoutMemoryForTheList) {
  add(1);
  failAllocationAfter(0);
  testing::internal::CaptureStdout();
  EXPECT_EQ(add(2), 0);
  EXPECT_EQ(testing::internal::GetCapturedStdout(),
            "\nERROR: isDuplicateEntryInWWPNList: realloc failed");
  EXPECT_EQ(list, nullptr);
  EXPECT_EQ(count, 0);
}

TEST_F(Wwpn_List, IsDroppedWithoutMemoryForAName) {
  add(1);
  failAllocationAfter(1);
  testing::internal::CaptureStdout();
  EXPECT_EQ(add(2), 0);
  EXPECT_EQ(testing::internal::GetCapturedStdout(),
            "\nERROR: isDuplicateEntryInWWPNList: malloc failed");
  EXPECT_EQ(list, nullptr);
  tvxSetAllocator(nullptr);
  EXPECT_EQ(add(1), 0);  // read as no duplicate afterwards
}

}  // namespace
}  // namespace cimrt
