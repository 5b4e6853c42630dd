// Status, type, speed, service class and FC-4 tables of a port.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "agent/FCPortTables.h"

namespace cimrt {
namespace {

std::vector<std::uint16_t> values(const Array<std::uint16_t>& array) {
  return {array.begin(), array.end()};
}

TEST(PortStatus, FollowsThePortState) {
  const struct {
    std::uint32_t state;
    std::uint16_t status;
    const char* text;
  } rows[] = {
      {0, 0, "Unknown"},
      {1, 0, "Unknown"},
      {2, 2, "OK"},
      {3, 10, "Stopped"},
      {4, 1, "Other"},
      {5, 11, "InService"},
      {6, 1, "Other"},
      {7, 6, "Error"},
      {8, 0x8008, "InService"},
      {9, 0, "Unknown"},
      {20, 0x8014, "Operational. Need RESET"},
      {21, 0x8015, "Link down. Need RESET"},
      {22, 0x8016, "Disable"},
      {23, 0, "Unknown"},
  };
  for (const auto& row : rows) {
    EXPECT_EQ(portStatus(row.state).operationalStatus, row.status) << row.state;
    EXPECT_STREQ(portStatus(row.state).description, row.text) << row.state;
  }
}

TEST(PortType, FollowsTheLibrarysType) {
  const struct {
    std::uint32_t type;
    std::uint16_t value;
    const char* text;
  } rows[] = {
      {1, 0, "Unknown"},  {2, 1, "Other"}, {3, 0, "Unknown"},       {4, 0, "Unknown"},
      {5, 10, "N"},       {6, 11, "NL"},   {7, 16, "FL"},           {8, 15, "F"},
      {9, 14, "E"},       {10, 18, "G"},   {20, 1, "Private Loop"}, {21, 1, "Point to Point"},
      {22, 0, "Unknown"},
  };
  for (const auto& row : rows) {
    EXPECT_EQ(portType(row.type).portType, row.value) << row.type;
    EXPECT_STREQ(portType(row.type).otherPortType, row.text) << row.type;
  }
}

TEST(PortSpeed, IsAValueAndNotASet) {
  EXPECT_EQ(portSpeed(1), 1'000'000'000u);
  EXPECT_EQ(portSpeed(2), 2'000'000'000u);
  EXPECT_EQ(portSpeed(4), 10'000'000'000u);
  EXPECT_EQ(portSpeed(8), 4'000'000'000u);
  EXPECT_EQ(portSpeed(16), 8'000'000'000u);
  EXPECT_EQ(portSpeed(32), 16'000'000'000u);
  EXPECT_EQ(portSpeed(0), 0u);
  EXPECT_EQ(portSpeed(3), 0u);
  EXPECT_EQ(portSpeed(64), 0u);
}

TEST(MaxPortSpeed, TakesTheFirstBitInItsOrder) {
  EXPECT_EQ(maxPortSpeed(0x3F), 16'000'000'000u);
  EXPECT_EQ(maxPortSpeed(0x1F), 10'000'000'000u);
  EXPECT_EQ(maxPortSpeed(0x1B), 8'000'000'000u);
  EXPECT_EQ(maxPortSpeed(0x0B), 4'000'000'000u);
  EXPECT_EQ(maxPortSpeed(0x03), 2'000'000'000u);
  EXPECT_EQ(maxPortSpeed(0x01), 1'000'000'000u);
  EXPECT_EQ(maxPortSpeed(0x40), 0u);
  EXPECT_EQ(maxPortSpeed(0), 0u);
}

TEST(ClassesOfService, AreTakenFromTheirBits) {
  EXPECT_EQ(values(classesOfService(0x5F)), (std::vector<std::uint16_t>{7, 1, 2, 3, 4, 5}));
  EXPECT_EQ(values(classesOfService(0x08)), (std::vector<std::uint16_t>{3}));
  EXPECT_EQ(values(classesOfService(0)), (std::vector<std::uint16_t>{0}));
  EXPECT_EQ(values(classesOfService(0x20)), (std::vector<std::uint16_t>{0}));
}

TEST(Fc4Types, EmptyMaskGivesOneZero) {
  EXPECT_EQ(values(fc4Types({})), (std::vector<std::uint16_t>{0}));
}

TEST(Fc4Types, EveryListedBitGivesItsValueInTheTablesOrder) {
  const struct {
    std::size_t word;
    std::uint32_t bits;
    std::vector<std::uint16_t> types;
  } rows[] = {
      {3, 0x30, {4, 5}},           {2, 0x03, {8, 9}},       {1, 0xEE, {17, 18, 19, 21, 22, 23}},
      {0, 0x1E, {25, 26, 27, 28}}, {7, 0x15, {32, 34, 36}}, {11, 0x01, {64}},
      {9, 0x07, {80, 81, 82}},     {8, 0x01, {88}},         {15, 0x01, {96}},
  };
  std::array<std::uint32_t, 32> all{};
  std::vector<std::uint16_t> expected;
  for (const auto& row : rows) {
    std::array<std::uint32_t, 32> mask{};
    mask[row.word] = row.bits;
    all[row.word] = row.bits;
    EXPECT_EQ(values(fc4Types(mask)), row.types) << row.word;
    expected.insert(expected.end(), row.types.begin(), row.types.end());
  }
  EXPECT_EQ(values(fc4Types(all)), expected);
}

TEST(Fc4Types, BitsOutsideTheListGiveOneFinalOne) {
  std::array<std::uint32_t, 32> mask{};
  mask[2] = 0x01;
  mask[31] = 0x80;
  mask[5] = 0x01;
  EXPECT_EQ(values(fc4Types(mask)), (std::vector<std::uint16_t>{8, 1}));
  std::array<std::uint32_t, 32> onlyOther{};
  onlyOther[2] = 0x04;
  EXPECT_EQ(values(fc4Types(onlyOther)), (std::vector<std::uint16_t>{1}));
}

}  // namespace
}  // namespace cimrt
