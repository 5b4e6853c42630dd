#include <gtest/gtest.h>

#include <map>
#include <set>
#include <string>

#include "access/TVX_Runtime_Loader.h"

namespace {

using cimrt::TVX_Entry_Point;
using cimrt::TVX_Family;
using cimrt::TVX_Missing;
namespace entry_points = cimrt::entry_points;

TEST(Entry_Points, AreAHundredAndEightyEight) {
  EXPECT_EQ(entry_points::COUNT, 188U);
  std::map<TVX_Family, int> families;
  for (const TVX_Entry_Point& entry : entry_points::TABLE) ++families[entry.family];
  EXPECT_EQ(families[TVX_Family::RM_TWO_NAMES], 142);
  EXPECT_EQ(families[TVX_Family::LRM_ONLY], 6);
  EXPECT_EQ(families[TVX_Family::RM_ONE_NAME], 17);
  EXPECT_EQ(families[TVX_Family::BOARD_NUMBER], 1);
  EXPECT_EQ(families[TVX_Family::SNIA], 13);
  EXPECT_EQ(families[TVX_Family::CPQFC] + families[TVX_Family::CPQFC_FALLBACK], 9);
}

TEST(Entry_Points, HaveDistinctNamesOfTheirFamilysForm) {
  const std::map<TVX_Family, std::string> prefixes = {
      {TVX_Family::RM_TWO_NAMES, "LRM_"},
      {TVX_Family::LRM_ONLY, "LRM_Ini_"},
      {TVX_Family::RM_ONE_NAME, "RM_"},
      {TVX_Family::SNIA, "HBA_"},
      {TVX_Family::CPQFC, "CPQFC_"},
      {TVX_Family::BOARD_NUMBER, "TvxGetBoardNumber"},
      {TVX_Family::CPQFC_FALLBACK, "CPQFC_CloseAdapter"}};
  std::set<std::string> names;
  for (const TVX_Entry_Point& entry : entry_points::TABLE) {
    if (entry.name.empty()) continue;
    EXPECT_TRUE(names.insert(std::string(entry.name)).second) << entry.name;
    EXPECT_TRUE(entry.name.starts_with(prefixes.at(entry.family))) << entry.name;
  }
  EXPECT_EQ(names.size(), 182U);
}

TEST(Entry_Points, HaveASecondNameWithoutTheLeadingLetterInOneFamilyOnly) {
  for (const TVX_Entry_Point& entry : entry_points::TABLE) {
    if (entry.name.empty()) continue;
    const std::string name(entry.name);
    EXPECT_EQ(entry.secondName(), entry.family == TVX_Family::RM_TWO_NAMES ? name.substr(1) : name);
  }
}

TEST(Entry_Points, HaveTheMissingValuesOfTheExceptions) {
  const std::map<std::string, TVX_Missing> exceptions = {
      {"HBA_GetNumberOfAdapters", TVX_Missing::ZERO},
      {"RM_GetNumberOfLocalAdapters", TVX_Missing::ZERO},
      {"RM_GetNextVpdEntry", TVX_Missing::ZERO},
      {"RM_GetAttributeValue", TVX_Missing::ZERO},
      {"LRM_CNA_FCOE_SetFIPParams", TVX_Missing::ZERO},
      {"LRM_CNA_FCOE_GetFIPParams", TVX_Missing::ZERO},
      {"LRM_CNA_FCOE_SetFCFConnectList", TVX_Missing::ZERO},
      {"LRM_CNA_FCOE_GetFCFConnectList", TVX_Missing::ZERO},
      {"TvxGetBoardNumber", TVX_Missing::MINUS_ONE},
      {"HBA_CloseAdapter", TVX_Missing::NOTHING},
      {"HBA_RefreshInformation", TVX_Missing::NOTHING},
      {"CPQFC_CloseAdapter", TVX_Missing::NOTHING}};
  std::size_t found = 0;
  for (const TVX_Entry_Point& entry : entry_points::TABLE) {
    const auto exception = exceptions.find(std::string(entry.name));
    const bool isException = exception != exceptions.end();
    found += isException ? 1 : 0;
    EXPECT_EQ(entry.missing, isException ? exception->second : TVX_Missing::ONE) << entry.name;
  }
  EXPECT_EQ(found, exceptions.size());
}

TEST(Entry_Points, AreFoundByName) {
  EXPECT_EQ(entry_points::TABLE[entry_points::find("LRM_ResetHBA")].name, "LRM_ResetHBA");
  EXPECT_EQ(entry_points::find("RM_ResetHBA"), entry_points::COUNT);
  EXPECT_EQ(entry_points::find(""), entry_points::COUNT);
}

}  // namespace
