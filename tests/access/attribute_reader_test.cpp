#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <string>

#include "access/TVX_AttributeReader.h"
#include "support/Fake_Libraries.h"
#include "support/Log_Capture.h"

namespace cimrt {
namespace {

using testing::ElementsAre;
using tvx::test::Fake_Libraries;
using tvx::test::Log_Capture;
using tvx::test::Logged;

class Attribute_Reader : public testing::Test {
 protected:
  /// Makes the library answer every key with these bytes.
  void answer(std::string bytes, RM_STATUS status = 0) {
    libraries.provide(
        RM_GetAttributeValue,
        [this, bytes = std::move(bytes), status](const void*, std::uint32_t, std::uint32_t* length,
                                                 RM_STATUS* out) -> void* {
          kept = bytes;
          *length = static_cast<std::uint32_t>(kept.size());
          *out = status;
          return kept.data();
        });
    libraries.load();
  }

  Fake_Libraries libraries;
  Log_Capture capture;
  std::string kept;
};

TEST_F(Attribute_Reader, AMissingReaderIsAFailedRead) {
  libraries.load();
  const TVX_Attribute attribute = findAttribute("block", 1);
  EXPECT_EQ(attribute.value, nullptr);
  EXPECT_EQ(attribute.status, 1);
  EXPECT_EQ(attribute.length, 0U);
}

TEST_F(Attribute_Reader, AValueWithAFailureStatusIsNone) {
  answer("text", 9);
  std::string text = "old";
  EXPECT_FALSE(readTextAttribute("block", 1, "_Label", text));
  EXPECT_EQ(text, "");
  std::uint32_t number = 7;
  EXPECT_FALSE(readNumberAttribute("block", 1, "_Label", number));
  EXPECT_EQ(number, 7U);
  EXPECT_THAT(capture.lines(),
              ElementsAre(Logged{5, "ERROR: _Label: RM_GetHBAAttributes call failed (9)"},
                          Logged{5, "ERROR: RM_GetHBAAttributeValue HA__Label call failed (9)"}));
}

TEST_F(Attribute_Reader, NumbersAreFourBytesAtMost) {
  std::uint32_t number = 0;
  answer(std::string("\x78\x56\x34\x12\xFF\xFF", 6));
  EXPECT_TRUE(readNumberAttribute("block", 1, "_Label", number));
  EXPECT_EQ(number, 0x12345678U);
  EXPECT_TRUE(capture.has(5, "_Label: [ 305419896 ]"));
  answer("\x2A");
  EXPECT_TRUE(readNumberAttribute("block", 1, "_Label", number));
  EXPECT_EQ(number, 42U);
  answer("");
  EXPECT_FALSE(readNumberAttribute("block", 1, "_Label", number));
  EXPECT_EQ(number, 42U);
}

TEST_F(Attribute_Reader, TextsEndAtTheirNulTheirLengthOr255Bytes) {
  std::string text;
  answer(std::string("ab\0cd", 5));
  EXPECT_TRUE(readTextAttribute("block", 1, "_Label", text));
  EXPECT_EQ(text, "ab");
  EXPECT_TRUE(capture.has(5, "_Label : [ ab ]"));
  answer("abc");
  EXPECT_TRUE(readTextAttribute("block", 1, "_Label", text));
  EXPECT_EQ(text, "abc");
  answer(std::string(1000, 'x'));
  EXPECT_TRUE(readTextAttribute("block", 1, "_Label", text));
  EXPECT_EQ(text, std::string(255, 'x'));
  answer("");
  EXPECT_TRUE(readTextAttribute("block", 1, "_Label", text));
  EXPECT_EQ(text, "");
}

}  // namespace
}  // namespace cimrt
