// The texts that name a logical unit.
#include <gtest/gtest.h>

#include <algorithm>
#include <initializer_list>
#include <numeric>
#include <string>

#include "agent/SanTexts.h"
#include "common/CLogger.h"
#include "support/Log_Capture.h"

namespace cimrt::test {
namespace {

constexpr const char* INVALID = "INVALID Descriptor";

/// An identifier of `length` bytes: `first`, then 1, 2, 3 and so on.
DeviceIdentification identifier(std::uint32_t type, std::uint32_t length, std::uint8_t first) {
  DeviceIdentification result;
  result.identifierType = type;
  result.identifierLength = length;
  std::iota(result.identifier.begin(), result.identifier.end(), std::uint8_t{0});
  result.identifier[0] = first;
  return result;
}

std::string nameOf(const DeviceIdentification& identification) {
  const tvx::test::Log_Capture capture;
  return deviceName(identification, identifierText(identification));
}

class San_Target : public Target {
 public:
  San_Target() {
    portWWN = "500C0FF12A001002";
    fcpLun = 0x0807060504030201;
    vendor = "ACMESTOR";
    model = "ARRAY 7200      ";
    revision = "0410";
    serialNumber = "SN1";
    deviceIdentification = identifier(3, 8, 0x50);
  }
};

TEST(San_Texts, LunIsItsBytesInMemoryOrder) {
  EXPECT_EQ(lunText(0x0807060504030201), "0102030405060708");
  EXPECT_EQ(lunText(0xFF), "FF00000000000000");
}

TEST(San_Texts, IdentifiersOfThreeLengthsHaveATextAndOthersAreReported) {
  const tvx::test::Log_Capture capture;
  EXPECT_EQ(identifierText(identifier(1, 8, 0xAB)), "AB01020304050607");
  EXPECT_EQ(identifierText(identifier(1, 12, 0xAB)), "AB0102030405060708090A0B");
  EXPECT_EQ(identifierText(identifier(1, 16, 0xAB)), "AB0102030405060708090A0B0C0D0E0F");
  EXPECT_FALSE(capture.has(TVX_ERR, INVALID));
  std::size_t reported = 0;
  for (const std::uint32_t length : {0U, 1U, 7U, 9U, 15U, 20U, 32U, 255U}) {
    EXPECT_EQ(identifierText(identifier(1, length, 0xAB)), "") << length;
    EXPECT_EQ(capture.count(TVX_ERR, INVALID), ++reported);
  }
}

TEST(San_Texts, NAANameLeavesTheFormatOut) {
  for (const std::uint8_t first : std::initializer_list<std::uint8_t>{0x10, 0x2F, 0x50})
    EXPECT_EQ(nameOf(identifier(3, 8, first)), "020304050607") << int{first};
  EXPECT_EQ(nameOf(identifier(3, 16, 0x60)), "0102030405060708090A0B0C0D0E0F");
}

TEST(San_Texts, NAANameOfAnotherFormatIsTheWholeIdentifier) {
  EXPECT_EQ(nameOf(identifier(3, 8, 0x00)), "0001020304050607");
  EXPECT_EQ(nameOf(identifier(3, 8, 0x30)), "3001020304050607");
  EXPECT_EQ(nameOf(identifier(3, 8, 0x4F)), "4F01020304050607");
  EXPECT_EQ(nameOf(identifier(3, 8, 0x70)), "7001020304050607");
  EXPECT_EQ(nameOf(identifier(3, 8, 0xF0)), "F001020304050607");
}

TEST(San_Texts, NAANameIsMadeFromAnyLength) {
  EXPECT_EQ(nameOf(identifier(3, 20, 0x60)).size(), 2U * 19);
  EXPECT_EQ(nameOf(identifier(3, 255, 0x50)).size(), 2U * 253);
  EXPECT_EQ(nameOf(identifier(3, 3, 0x50)), "02");
}

TEST(San_Texts, NAANameIsEmptyWhereNothingIsLeft) {
  for (const std::uint32_t length : {0U, 1U, 2U})
    EXPECT_EQ(nameOf(identifier(3, length, 0x50)), "") << length;
  EXPECT_EQ(nameOf(identifier(3, 1, 0x60)), "");
}

TEST(San_Texts, OtherNamesAreTheIdentifier) {
  for (const std::uint32_t type : {0U, 1U, 2U, 4U, 8U, 15U})
    EXPECT_EQ(nameOf(identifier(type, 8, 0x50)), "5001020304050607") << type;
  EXPECT_EQ(nameOf(identifier(1, 20, 0x50)), "");
}

TEST(San_Texts, UnitIsDescribedByItsInquiryData) {
  const Unit_Texts texts = unitTexts("10000254560C3001", San_Target());
  EXPECT_EQ(texts.port, "10000254560C3001");
  EXPECT_EQ(texts.target, "500C0FF12A001002");
  EXPECT_EQ(texts.lun, "0102030405060708");
  EXPECT_EQ(texts.identifier, "5001020304050607");
  EXPECT_EQ(texts.inquiry, "ACMESTOR ARRAY 7200       Revision 0410");
  EXPECT_EQ(texts.description, "ACMESTOR ARRAY 7200       Revision 0410 Serial Number SN1");
}

TEST(San_Texts, DescriptionIsCutToTheStandardLengths) {
  San_Target target;
  target.vendor = "123456789";
  target.model = "12345678901234567";
  target.revision = "Unknown";
  target.serialNumber = std::string(41, 's');
  const Unit_Texts texts = unitTexts("p", target);
  EXPECT_EQ(texts.inquiry, "12345678 1234567890123456 Revision Unkn");
  EXPECT_EQ(texts.description, texts.inquiry + " Serial Number " + std::string(40, 's'));
}

}  // namespace
}  // namespace cimrt::test
