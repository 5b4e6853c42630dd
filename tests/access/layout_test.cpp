#include "layout.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "rmapi/rmapi.h"

namespace tvx::test {

void PrintTo(const Layout& layout, std::ostream* out) {
  *out << layout.what << " = " << layout.value;
}

namespace {

TEST(Snia_Header, AgreesWithThePublishedOne) {
  const std::vector<Layout> own = {TVX_SNIA_LAYOUTS};
  EXPECT_GT(own.size(), 80U);
  EXPECT_THAT(own, testing::ElementsAreArray(publishedLayouts()));
}

TEST(Snia_Header, RowsOfTheTargetMappingAre304BytesBehindEight) {
  EXPECT_EQ(sizeof(HBA_FCPSCSIENTRY), 304U);
  EXPECT_EQ(offsetof(HBA_FCPTARGETMAPPING, entry), 8U);
}

TEST(Management_Header, RecordsHaveTheirSizes) {
  const std::vector<Layout> own = {
      TVX_SIZE(RM_LunEntry),         TVX_SIZE(RM_LunList),         TVX_SIZE(RM_DriverParam),
      TVX_SIZE(RM_OASLunEntry),      TVX_SIZE(RM_OASLunList),      TVX_SIZE(RM_VPortEntry),
      TVX_SIZE(RM_VPortList),        TVX_SIZE(RM_VPortAttributes), TVX_SIZE(RM_DumpFileNames),
      TVX_SIZE(RM_LocalHBASelector), TVX_SIZE(RM_LocalHBAInfo),    TVX_SIZE(RM_DiagResult),
      TVX_SIZE(RM_LoadListEntry),    TVX_SIZE(RM_EventLogConfig),  TVX_SIZE(RM_EventLogModule),
      TVX_SIZE(CPQFC_QoSEntry)};
  const std::vector<Layout> wanted = {
      {"RM_LunEntry", 12},        {"RM_LunList", 20},          {"RM_DriverParam", 132},
      {"RM_OASLunEntry", 36},     {"RM_OASLunList", 40},       {"RM_VPortEntry", 24},
      {"RM_VPortList", 28},       {"RM_VPortAttributes", 344}, {"RM_DumpFileNames", 264},
      {"RM_LocalHBASelector", 8}, {"RM_LocalHBAInfo", 172},    {"RM_DiagResult", 48},
      {"RM_LoadListEntry", 100},  {"RM_EventLogConfig", 7220}, {"RM_EventLogModule", 112},
      {"CPQFC_QoSEntry", 36}};
  EXPECT_THAT(own, testing::ElementsAreArray(wanted));
}

TEST(Management_Header, FieldsStandAtTheirOffsets) {
  const std::vector<Layout> own = {TVX_AT(RM_LunList, entry),
                                   TVX_AT(RM_LunEntry, osLunValid),
                                   TVX_AT(RM_LunEntry, osLun),
                                   TVX_AT(RM_DriverParam, low),
                                   TVX_AT(RM_DriverParam, high),
                                   TVX_AT(RM_DriverParam, def),
                                   TVX_AT(RM_DriverParam, current),
                                   TVX_AT(RM_DriverParam, exportFlag),
                                   TVX_AT(RM_DriverParam, dynamic),
                                   TVX_AT(RM_DriverParam, help),
                                   TVX_AT(RM_OASLunList, entry),
                                   TVX_AT(RM_OASLunEntry, lun),
                                   TVX_AT(RM_OASLunEntry, state),
                                   TVX_AT(RM_VPortList, entry),
                                   TVX_AT(RM_VPortEntry, wwnn),
                                   TVX_AT(RM_VPortEntry, fcId),
                                   TVX_AT(RM_VPortAttributes, name),
                                   TVX_AT(RM_DumpFileNames, name),
                                   TVX_AT(RM_LocalHBASelector, index),
                                   TVX_AT(RM_DiagResult, state),
                                   TVX_AT(RM_DiagResult, cyclesCompleted),
                                   TVX_AT(RM_DiagResult, totalTime),
                                   TVX_AT(RM_DiagResult, result),
                                   TVX_AT(RM_DiagResult, errorCount),
                                   TVX_AT(RM_LoadList, entry),
                                   TVX_AT(RM_LoadListEntry, startAddress),
                                   TVX_AT(RM_LoadListEntry, programId),
                                   TVX_AT(RM_LoadListEntry, description),
                                   TVX_AT(RM_LoadListEntry, wakeup),
                                   TVX_AT(RM_LoadListEntry, programType),
                                   TVX_AT(RM_LoadListEntry, version),
                                   TVX_AT(RM_EventLogConfig, count),
                                   TVX_AT(CPQFC_QoSTable, entry),
                                   TVX_AT(CPQFC_QoSEntry, target),
                                   TVX_AT(CPQFC_QoSEntry, tag)};
  std::vector<std::size_t> offsets;
  for (const Layout& layout : own) offsets.push_back(layout.value);
  EXPECT_THAT(offsets,
              testing::ElementsAre(8, 10, 11, 32, 36, 40, 44, 48, 50, 52, 4, 8, 17, 4, 8, 16, 20, 8,
                                   4, 4, 12, 16, 20, 28, 4, 8, 16, 24, 48, 52, 76, 12, 4, 8, 32));
}

}  // namespace
}  // namespace tvx::test
