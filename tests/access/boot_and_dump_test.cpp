// Boot code, dump files and extended event logging: what the wrapper asks, answers and logs.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cstring>
#include <string>
#include <vector>

#include "access/TVX_MethodWrapper.h"
#include "support/Fake_Libraries.h"
#include "support/Log_Capture.h"

namespace cimrt {
namespace {

using testing::ElementsAre;
using tvx::test::Fake_Libraries;
using tvx::test::Log_Capture;
using tvx::test::Logged;

const HBA_WWN PORT = {{0x10, 0, 0, 0, 0, 0, 0, 0x41}};

class Port_Wrappers : public testing::Test {
 protected:
  void SetUp() override {
    libraries.load();
    provideLocal(1);
    libraries.provide(RM_StatusString, [](RM_STATUS, char* text, std::uint32_t) {
      std::strcpy(text, "a text");
      return 0;
    });
    capture.forget();
  }
  void TearDown() override { tvxSetAllocator(nullptr); }

  void provideLocal(std::uint32_t flag) {
    libraries.provide(RM_IsLocalHBA, [flag](HBA_WWN, std::uint32_t* local) {
      *local = flag;
      return 0;
    });
  }
  static void refuseMemory() {
    tvxSetAllocator([](std::size_t) -> void* { return nullptr; });
  }
  static std::string printed(RM_STATUS status) {
    return "Status: <" + std::to_string(status) + ">:a text";
  }

  Fake_Libraries libraries;
  Log_Capture capture;
};

// --- Boot code -----------------------------------------------------------------------------------

class Boot_Code : public Port_Wrappers {
 protected:
  void SetUp() override {
    Port_Wrappers::SetUp();
    libraries.provide(LRM_SetBootBiosState, [this](HBA_WWN wwpn, std::uint32_t state) {
      EXPECT_EQ(wwpn.wwn[7], 0x41);
      states.push_back(state);
      return status;
    });
    libraries.provide(LRM_GetHBAAttributes, [this](HBA_WWN, void*, std::uint32_t* size) {
      EXPECT_EQ(*size, 2048U);
      return status;
    });
    libraries.provide(RM_GetAttributeValue, [this](const void*, std::uint32_t key,
                                                   std::uint32_t* length, RM_STATUS* result) {
      EXPECT_EQ(key, 532U);
      EXPECT_EQ(*result, 1);
      *length = 1;
      *result = attributeStatus;
      return attribute;
    });
  }

  RM_STATUS status = 0;
  RM_STATUS attributeStatus = 0;
  std::uint8_t byte = 0xA7;
  void* attribute = &byte;
  std::vector<std::uint32_t> states;
};

TEST_F(Boot_Code, IsSwitchedByOneCharacter) {
  for (const char word : {'E', 'e', 'D', 'd'})
    EXPECT_EQ(TVX_MethodWrapper::tvxcimSetBootBiosState(PORT, &word), 0);
  EXPECT_THAT(states, ElementsAre(1U, 1U, 0U, 0U));
  EXPECT_TRUE(capture.has(5, "Entering TVX_MethodWrapper::tvxcimSetBootBiosState"));
  EXPECT_TRUE(capture.has(5, "CtrlWord is  E"));
  EXPECT_EQ(capture.count(5, "BootBios State has been set"), 4U);
}

TEST_F(Boot_Code, AnyOtherCharacterDoesNotReachTheLibrary) {
  for (const char word : {'x', '1', '\0', '\xE9'})
    EXPECT_EQ(TVX_MethodWrapper::tvxcimSetBootBiosState(PORT, &word), 1);
  EXPECT_TRUE(states.empty());
  EXPECT_EQ(TVX_MethodWrapper::tvxcimSetBootBiosState(PORT, nullptr), 4);
  EXPECT_TRUE(capture.has(3, "Null Pointer Assignment to argument CtrlWord"));
}

TEST_F(Boot_Code, OfAPortThatIsNotLocalGoesToTheLibraryToo) {
  provideLocal(0);
  status = 221;
  const char word = 'E';
  EXPECT_EQ(TVX_MethodWrapper::tvxcimSetBootBiosState(PORT, &word), 221);
  EXPECT_TRUE(capture.has(3, "ERROR: RM_SetBootBiosState failure: 221"));
}

TEST_F(Boot_Code, IsReadAsTheByteThatTheLibraryHas) {
  std::uint32_t state = 0;
  EXPECT_EQ(TVX_MethodWrapper::tvxcimGetBootBiosState(PORT, &state), 0);
  EXPECT_EQ(state, 0xA7U);
  EXPECT_TRUE(capture.has(5, "Entering TVX_MethodWrapper::tvxcimGetBootBiosState"));
  EXPECT_TRUE(capture.has(5, "_BootCodeEnabled: [ 167 ]"));
}

TEST_F(Boot_Code, EveryFailedReadAnswersOne) {
  std::uint32_t state = 77;
  attributeStatus = 6;
  EXPECT_EQ(TVX_MethodWrapper::tvxcimGetBootBiosState(PORT, &state), 1);
  EXPECT_TRUE(capture.has(5, "ERROR: RM_GetHBAAttributeValue HA__BootCodeEnabled call failed (6)"));
  attributeStatus = 0;
  attribute = nullptr;
  EXPECT_EQ(TVX_MethodWrapper::tvxcimGetBootBiosState(PORT, &state), 1);
  EXPECT_TRUE(capture.has(5, "ERROR: RM_GetHBAAttributeValue HA__BootCodeEnabled call failed (0)"));
  status = 148;
  EXPECT_EQ(TVX_MethodWrapper::tvxcimGetBootBiosState(PORT, &state), 1);
  EXPECT_TRUE(capture.has(3, "ERROR: RM_GetHBAAttributes call failed (148)"));
  EXPECT_EQ(TVX_MethodWrapper::tvxcimGetBootBiosState(PORT, nullptr), 1);
  EXPECT_TRUE(capture.has(3, "Null Pointer Assignment to argument BootBiosState"));
  refuseMemory();
  EXPECT_EQ(TVX_MethodWrapper::tvxcimGetBootBiosState(PORT, &state), 1);
  EXPECT_TRUE(capture.has(3, "Unable to allocate the memory for the HBA attributes"));
  provideLocal(0);
  EXPECT_EQ(TVX_MethodWrapper::tvxcimGetBootBiosState(PORT, &state), 1);
  EXPECT_TRUE(capture.has(3, "INVALID wwpn"));
  EXPECT_EQ(state, 77U);
}

// --- Dumps ---------------------------------------------------------------------------------------

class Dumps : public Port_Wrappers {};

TEST_F(Dumps, AreWholeOrOfOneKind) {
  std::vector<int> options;
  RM_STATUS status = 0;
  libraries.provide(LRM_GenerateDump, [&](int option, HBA_WWN) {
    options.push_back(option);
    return status;
  });
  libraries.provide(LRM_GenerateEfdDump, [&](HBA_WWN, int option, int flags) {
    options.push_back(100 + option + flags);
    return status;
  });
  EXPECT_EQ(TVX_MethodWrapper::tvxcimDumpDiagnostic(PORT, -1), 0);
  EXPECT_EQ(TVX_MethodWrapper::tvxcimDumpDiagnostic(PORT, 3), 0);
  EXPECT_TRUE(capture.lines().empty());
  status = 9;
  EXPECT_EQ(TVX_MethodWrapper::tvxcimDumpDiagnostic(PORT, -1), 9);
  EXPECT_THAT(options, ElementsAre(0, 103, 0));
  EXPECT_THAT(capture.lines(),
              ElementsAre(Logged{5, "Failed to generate the dump file, exited with error code 9"},
                          Logged{5, printed(9)}));
}

TEST_F(Dumps, AreRemovedFromLocalPorts) {
  RM_STATUS status = 0;
  libraries.provide(LRM_DeleteDumpFiles, [&](HBA_WWN) { return status; });
  EXPECT_EQ(TVX_MethodWrapper::tvxcimDeleteDumpFiles(PORT), 0);
  status = 5;
  EXPECT_EQ(TVX_MethodWrapper::tvxcimDeleteDumpFiles(PORT), 5);
  EXPECT_TRUE(capture.has(5, "Failed to delete the Dump files, exited with error code 5"));
  EXPECT_FALSE(capture.has(5, printed(5)));
  provideLocal(0);
  EXPECT_EQ(TVX_MethodWrapper::tvxcimDeleteDumpFiles(PORT), 1);
  EXPECT_TRUE(capture.has(5, "INVALID wwpn"));
}

TEST_F(Dumps, NamesPassThrough) {
  RM_STATUS status = 0;
  libraries.provide(LRM_GetDumpFileNames, [&](HBA_WWN, RM_DumpFileNames* names) {
    names->count = 1;
    return status;
  });
  RM_DumpFileNames names{};
  EXPECT_EQ(TVX_MethodWrapper::GetDumpFileNames(PORT, &names), 0);
  EXPECT_EQ(names.count, 1U);
  EXPECT_TRUE(capture.has(5, "Entering the Get Dump filenames method"));
  EXPECT_TRUE(capture.has(5, "Exit the Get Dump filenames method"));
  status = 191;
  EXPECT_EQ(TVX_MethodWrapper::GetDumpFileNames(PORT, &names), 191);
  EXPECT_TRUE(capture.has(5, printed(191)));
  EXPECT_EQ(TVX_MethodWrapper::GetDumpFileNames(PORT, nullptr), 4);
  EXPECT_TRUE(capture.has(5, "FileEntriesPointer NULL"));
  provideLocal(0);
  EXPECT_EQ(TVX_MethodWrapper::GetDumpFileNames(PORT, &names), 1);
}

TEST_F(Dumps, DirectoryIsRead) {
  RM_STATUS status = 0;
  libraries.provide(LRM_GetDumpDirectoryA, [&](HBA_WWN, char* directory, std::uint32_t size) {
    EXPECT_EQ(size, 256U);
    std::strcpy(directory, "/var/dumps");
    return status;
  });
  char directory[256] = {};
  EXPECT_EQ(TVX_MethodWrapper::tvxcimGetDumpDirectory(PORT, directory), 0);
  EXPECT_STREQ(directory, "/var/dumps");
  status = 3;
  EXPECT_EQ(TVX_MethodWrapper::tvxcimGetDumpDirectory(PORT, directory), 3);
  EXPECT_THAT(capture.lines(),
              ElementsAre(Logged{5, "Failed to get the Dump directory, returned with error code 3"},
                          Logged{5, printed(3)}));
}

TEST_F(Dumps, DirectoryIsSetAndItsFailuresAreTold) {
  const std::string failed = "ERROR: tvxcimSetDumpDirectory: RM_SetDumpDirectory call failed";
  const struct {
    RM_STATUS status;
    std::string text;
  } rows[] = {
      {0, "tvxcimSetDumpDirectory: Success"},
      {27, failed + ". The specified directory [' / vmfs / volumes / store'] cannot be opened"},
      {160, failed + ". The configuration file could not be opened"},
      {178, failed + ". The configuration file could not be opened"},
      {2, failed + " with error code : 2 \n"}};
  for (const auto& row : rows) {
    capture.forget();
    libraries.provide(LRM_SetDumpDirectory, [&](HBA_WWN, const char* path) {
      EXPECT_STREQ(path, "store");
      return row.status;
    });
    EXPECT_EQ(TVX_MethodWrapper::tvxcimSetDumpDirectory(PORT, "store"), row.status);
    EXPECT_THAT(capture.lines(), ElementsAre(Logged{5, row.text}));
  }
  EXPECT_EQ(TVX_MethodWrapper::tvxcimSetDumpDirectory(PORT, nullptr), 4);
}

TEST_F(Dumps, RetentionCountIsReadFromLocalPorts) {
  RM_STATUS status = 0;
  libraries.provide(LRM_GetDumpRetentionCount, [&](HBA_WWN, std::uint32_t* count) {
    *count = 7;
    return status;
  });
  std::uint32_t count = 0;
  EXPECT_EQ(TVX_MethodWrapper::tvxcimGetRetentionCount(PORT, &count), 0);
  EXPECT_EQ(count, 7U);
  status = 2;
  EXPECT_EQ(TVX_MethodWrapper::tvxcimGetRetentionCount(PORT, &count), 2);
  EXPECT_TRUE(capture.has(5, "Failed to get the retention count, returned with error code 2"));
  provideLocal(0);
  EXPECT_EQ(TVX_MethodWrapper::tvxcimGetRetentionCount(PORT, &count), 1);
  EXPECT_TRUE(capture.has(5, "INVALID wwpn"));
}

TEST_F(Dumps, RetentionCountIsSetWithinItsBounds) {
  provideLocal(0);  // not asked for
  RM_STATUS status = 0;
  std::vector<std::uint32_t> counts;
  libraries.provide(LRM_SetDumpRetentionCount, [&](HBA_WWN, std::uint32_t count) {
    counts.push_back(count);
    return status;
  });
  EXPECT_EQ(TVX_MethodWrapper::tvxcimSetRetentionCount(PORT, 1), 0);
  EXPECT_EQ(TVX_MethodWrapper::tvxcimSetRetentionCount(PORT, 20), 0);
  EXPECT_TRUE(capture.lines().empty());
  EXPECT_EQ(TVX_MethodWrapper::tvxcimSetRetentionCount(PORT, 0), 1);
  EXPECT_EQ(TVX_MethodWrapper::tvxcimSetRetentionCount(PORT, 21), 1);
  EXPECT_EQ(TVX_MethodWrapper::tvxcimSetRetentionCount(PORT, 0xFFFFFFFF), 1);
  EXPECT_EQ(capture.count(5, "ERROR: RetentionCount value must be in-between 1 and 20"), 3U);
  EXPECT_THAT(counts, ElementsAre(1U, 20U));
  status = 6;
  EXPECT_EQ(TVX_MethodWrapper::tvxcimSetRetentionCount(PORT, 5), 6);
  EXPECT_TRUE(capture.has(5, "Failed to set the retention count, exited with error code 6"));
  EXPECT_TRUE(capture.has(5, printed(6)));
}

TEST_F(Dumps, FirmwareDumpsAreOfAPortOrOfAnAdapter) {
  RM_STATUS status = 0;
  libraries.provide(LRM_RetrieveFATDump, [&](HBA_WWN) { return status; });
  libraries.provide(LRM_RetrieveFATDump2, [](HBA_WWN) { return 12; });
  EXPECT_EQ(TVX_MethodWrapper::tvxcimRetrieveFATDump(0, PORT), 0);
  EXPECT_THAT(capture.lines(), ElementsAre(Logged{5, "Inside tvxcimRetrieveFATDump "},
                                           Logged{5, "Exiting tvxcimRetrieveFATDump \n"}));
  EXPECT_EQ(TVX_MethodWrapper::tvxcimRetrieveFATDump(1, PORT), 12);
  EXPECT_TRUE(capture.has(5, printed(12)));
}

TEST_F(Dumps, CoreDumpsNeedTheFeature) {
  RM_STATUS featureStatus = 0;
  RM_STATUS status = 0;
  std::uint32_t feature = 1;
  int dumps = 0;
  libraries.provide(LRM_GetHBAFeature, [&](HBA_WWN, std::uint32_t id, std::uint32_t* value) {
    EXPECT_EQ(id, 430U);
    *value = feature;
    return featureStatus;
  });
  libraries.provide(LRM_GenerateCoreDump, [&](HBA_WWN, const char* options) {
    EXPECT_STREQ(options, "all");
    ++dumps;
    return status;
  });
  EXPECT_EQ(TVX_MethodWrapper::tvxcimGetCoreDump(PORT, "all"), 0);
  EXPECT_TRUE(capture.has(5, "Options all"));
  feature = 0;
  EXPECT_EQ(TVX_MethodWrapper::tvxcimGetCoreDump(PORT, "all"), 251);
  EXPECT_EQ(dumps, 1);
  featureStatus = 2;  // a feature that can't be asked for counts as there
  status = 247;
  EXPECT_EQ(TVX_MethodWrapper::tvxcimGetCoreDump(PORT, "all"), 247);
  EXPECT_EQ(capture.count(5, printed(247)), 0U);
  status = 64;
  EXPECT_EQ(TVX_MethodWrapper::tvxcimGetCoreDump(PORT, "all"), 64);
  EXPECT_TRUE(capture.has(5, "Failed to generate core dump, exited with error code 64"));
  EXPECT_TRUE(capture.has(5, printed(64)));
  EXPECT_EQ(TVX_MethodWrapper::tvxcimGetCoreDump(PORT, nullptr), 4);
  provideLocal(0);
  EXPECT_EQ(TVX_MethodWrapper::tvxcimGetCoreDump(PORT, "all"), 1);
  EXPECT_TRUE(capture.has(5, "INVALID wwpn"));
}

// --- Extended event logging ----------------------------------------------------------------------

class Event_Logging : public Port_Wrappers {};

TEST_F(Event_Logging, IsReadIfItsCountFitsItsCapacity) {
  RM_STATUS status = 0;
  std::uint32_t count = 64;
  libraries.provide(LRM_Get_BE_EventLogConfigDataAll, [&](HBA_WWN, RM_EventLogConfig* config) {
    config->capacity = 64;
    config->count = count;
    return status;
  });
  TVX_Block block;
  EXPECT_EQ(TVX_MethodWrapper::GetExtFATAdvancedData(PORT, &block), 0);
  ASSERT_NE(block, nullptr);
  EXPECT_EQ(reinterpret_cast<const RM_EventLogConfig*>(block.get())->count, 64U);
  EXPECT_TRUE(capture.has(5, "Returned from RM call: 0, 64, 64"));
  block.reset();
  count = 65;
  EXPECT_EQ(TVX_MethodWrapper::GetExtFATAdvancedData(PORT, &block), 1);
  const std::string failed = "RM_Get_BE_EventLogConfigDataAll call failed, with error code : ";
  EXPECT_TRUE(capture.has(5, failed + "0, Invalid number of entries in FAT data : 65"));
  count = 3;
  status = 9;
  EXPECT_EQ(TVX_MethodWrapper::GetExtFATAdvancedData(PORT, &block), 9);
  EXPECT_TRUE(capture.has(5, failed + "9, Invalid number of entries in FAT data : 3"));
  refuseMemory();
  EXPECT_EQ(TVX_MethodWrapper::GetExtFATAdvancedData(PORT, &block), 1);
  EXPECT_TRUE(capture.has(1, "ERROR: malloc failed for RM_Get_BE_EventLogConfigDataAll data"));
  EXPECT_EQ(block, nullptr);
}

TEST_F(Event_Logging, OfAModuleIsSetWithinItsBounds) {
  RM_STATUS status = 0;
  std::vector<RM_EventLogModule> modules;
  libraries.provide(LRM_Set_BE_EventLogConfigDataModule,
                    [&](HBA_WWN, const RM_EventLogModule* module) {
                      modules.push_back(*module);
                      return status;
                    });
  const auto set = [](const char* a, const char* b, std::uint32_t portMask, std::uint32_t function,
                      std::uint32_t value) {
    return TVX_MethodWrapper::SetExtFATAdvancedData(PORT, a, b, portMask, function, value);
  };
  EXPECT_EQ(set("module", "level", 15, 255, 4), 0);
  ASSERT_EQ(modules.size(), 1U);
  EXPECT_EQ(modules[0].portMask, 15U);
  EXPECT_EQ(modules[0].functionMask, 255U);
  EXPECT_EQ(modules[0].value, 4U);
  EXPECT_STREQ(modules[0].text1, "module");
  EXPECT_STREQ(modules[0].text2, "level");
  EXPECT_EQ(modules[0].text2[49], '\0');
  EXPECT_EQ(set(nullptr, "b", 1, 1, 1), 1);
  EXPECT_EQ(set("a", nullptr, 1, 1, 1), 1);
  EXPECT_EQ(set("a", "b", 16, 1, 1), 1);
  EXPECT_EQ(set("a", "b", 1, 256, 1), 1);
  EXPECT_EQ(set("a", "b", 1, 1, 0), 1);
  EXPECT_EQ(modules.size(), 1U);
  EXPECT_EQ(capture.count(5,
                          "Invalid Module Parameter arguments, Valid values are portMask [1-15], "
                          "FunctionMask[0-255]"),
            5U);
  status = 8;
  EXPECT_EQ(set(std::string(300, 'x').c_str(), "b", 1, 1, 1), 8);
  EXPECT_EQ(std::string(modules[1].text1), std::string(49, 'x'));
  EXPECT_TRUE(capture.has(5, "Failed to set the advanced settings, returned with error code 8"));
}

TEST_F(Event_Logging, LevelsAndDefaultsPassThrough) {
  RM_STATUS status = 0;
  std::uint32_t seen = 0;
  libraries.provide(
      LRM_Set_BE_EventLogTraceLevel,
      [&](HBA_WWN wwpn, std::uint32_t a, std::uint32_t b, std::uint32_t c, std::uint32_t d) {
        EXPECT_EQ(wwpn.wwn[7], 0x41);
        seen = a * 1000 + b * 100 + c * 10 + d;
        return status;
      });
  libraries.provide(LRM_Set_BE_DefaultLoggingConfig, [&](HBA_WWN) { return status; });
  EXPECT_EQ(TVX_MethodWrapper::tvxcimSetAdvancedDumpTraceLevel(PORT, 1, 2, 3, 4), 0);
  EXPECT_EQ(seen, 1234U);
  EXPECT_EQ(TVX_MethodWrapper::tvxcimRestoreDefaultSettings(PORT), 0);
  EXPECT_TRUE(capture.lines().empty());
  status = 5;
  EXPECT_EQ(TVX_MethodWrapper::tvxcimSetAdvancedDumpTraceLevel(PORT, 1, 2, 3, 4), 5);
  EXPECT_EQ(TVX_MethodWrapper::tvxcimRestoreDefaultSettings(PORT), 5);
  EXPECT_TRUE(
      capture.has(5, "Failed to set the Advanced Dump TraceLevel, returned with error code 5"));
  EXPECT_TRUE(capture.has(5, "Failed to restore default settings, returned with error code 5"));
}

}  // namespace
}  // namespace cimrt
