#include "runtime/Conversions.h"

#include <gtest/gtest.h>

#include <charconv>
#include <clocale>
#include <cmath>
#include <cstdlib>
#include <cstring>
#include <limits>
#include <random>
#include <string>

namespace cimrt {
namespace {

/// What a reader makes of a text: the value, or nothing; a refused text must leave the output.
template <class T>
std::optional<T> read(int (*reader)(const char*, T&), const char* text) {
  T first{};
  T second = static_cast<T>(1);
  const int answer = reader(text, first);
  EXPECT_EQ(reader(text, second), answer);
  if (answer == 0) return first;
  EXPECT_EQ(answer, -1) << text;
  EXPECT_TRUE(first == T{} && second == static_cast<T>(1)) << "output changed for " << text;
  return std::nullopt;
}

TEST(StrToBoolean, AcceptsTheTwoWordsInAnyCase) {
  EXPECT_EQ(read(str_to_boolean, "true"), true);
  EXPECT_EQ(read(str_to_boolean, "TRUE"), true);
  EXPECT_EQ(read(str_to_boolean, "False"), false);
}

TEST(StrToBoolean, RefusesEverythingElse) {
  for (const char* text : {"", " true", "true ", "truely", "tru", "1", "0", "yes"})
    EXPECT_EQ(read(str_to_boolean, text), std::nullopt) << text;
}

TEST(StrToUint64, ReadsDecimalTextsOfEveryLength) {
  EXPECT_EQ(read(str_to_uint64, "0"), 0u);
  EXPECT_EQ(read(str_to_uint64, "7"), 7u);
  EXPECT_EQ(read(str_to_uint64, "42"), 42u);
  EXPECT_EQ(read(str_to_uint64, "007"), 7u);
  EXPECT_EQ(read(str_to_uint64, "1234"), 1234u);
  EXPECT_EQ(read(str_to_uint64, "18446744073709551615"), UINT64_MAX);
}

TEST(StrToUint64, DoesNotCheckTwentyDigitsForOverflow) {
  EXPECT_EQ(read(str_to_uint64, "18446744073709551616"), 0u);
  EXPECT_EQ(read(str_to_uint64, "99999999999999999999"), 7766279631452241919u);
}

TEST(StrToUint64, RefusesMoreThanTwentyDigits) {
  EXPECT_EQ(read(str_to_uint64, "000000000000000000001"), std::nullopt);
}

TEST(StrToUint64, ReadsUpperCaseHexadecimal) {
  EXPECT_EQ(read(str_to_uint64, "0xFF"), 255u);
  EXPECT_EQ(read(str_to_uint64, "0X1A"), 26u);
  EXPECT_EQ(read(str_to_uint64, "0xFFFFFFFFFFFFFFFF"), UINT64_MAX);
  EXPECT_EQ(read(str_to_uint64, "0xff"), std::nullopt);
  EXPECT_EQ(read(str_to_uint64, "0x00000000000000001"), std::nullopt);
  EXPECT_EQ(read(str_to_uint64, "0xG"), std::nullopt);
}

TEST(StrToUint64, RefusesMalformedTexts) {
  for (const char* text : {"", " 1", "1 ", "+1", "-1", "12a", "123a", "1234x", "123 ", "0x", "x1",
                           "FF", "1x2", "1.0", "0x-1"})
    EXPECT_EQ(read(str_to_uint64, text), std::nullopt) << text;
}

TEST(StrToUint32, TakesUpperCaseHexadecimalOnly) {
  EXPECT_EQ(read(str_to_uint32, "0xff"), std::nullopt);
  EXPECT_EQ(read(str_to_uint32, "0xFF"), 255u);
  EXPECT_EQ(read(str_to_uint32, "0x"), std::nullopt);
}

TEST(StrToUnsigned, NarrowFormsRefuseWhatDoesNotFit) {
  EXPECT_EQ(read(str_to_uint8, "255"), 255);
  EXPECT_EQ(read(str_to_uint8, "256"), std::nullopt);
  EXPECT_EQ(read(str_to_uint16, "65535"), 65535);
  EXPECT_EQ(read(str_to_uint16, "65536"), std::nullopt);
  EXPECT_EQ(read(str_to_uint32, "4294967295"), 4294967295u);
  EXPECT_EQ(read(str_to_uint32, "4294967296"), std::nullopt);
}

TEST(StrToSigned, NarrowFormsRefuseWhatDoesNotFit) {
  EXPECT_EQ(read(str_to_sint8, "127"), 127);
  EXPECT_EQ(read(str_to_sint8, "128"), std::nullopt);
  EXPECT_EQ(read(str_to_sint8, "-128"), -128);
  EXPECT_EQ(read(str_to_sint8, "-129"), std::nullopt);
  EXPECT_EQ(read(str_to_sint16, "32768"), std::nullopt);
  EXPECT_EQ(read(str_to_sint16, "-32768"), -32768);
  EXPECT_EQ(read(str_to_sint32, "2147483647"), 2147483647);
  EXPECT_EQ(read(str_to_sint32, "-2147483649"), std::nullopt);
}

TEST(StrToSint64, TakesOneSignAndTheWholeRange) {
  EXPECT_EQ(read(str_to_sint64, "+5"), 5);
  EXPECT_EQ(read(str_to_sint64, "-5"), -5);
  EXPECT_EQ(read(str_to_sint64, "-0xFF"), -255);
  EXPECT_EQ(read(str_to_sint64, "9223372036854775807"), INT64_MAX);
  EXPECT_EQ(read(str_to_sint64, "9223372036854775808"), std::nullopt);
  EXPECT_EQ(read(str_to_sint64, "-9223372036854775808"), INT64_MIN);
  EXPECT_EQ(read(str_to_sint64, "-9223372036854775809"), std::nullopt);
  for (const char* text : {"", "+", "-", "--5", "+-5", "5-"})
    EXPECT_EQ(read(str_to_sint64, text), std::nullopt) << text;
}

TEST(StrToReal, NeedsADotAndADigitBehindIt) {
  EXPECT_EQ(read(str_to_real64, "2.0"), 2.0);
  EXPECT_EQ(read(str_to_real64, "-.5"), -0.5);
  EXPECT_EQ(read(str_to_real64, "+1.25e2"), 125.0);
  EXPECT_EQ(read(str_to_real64, "1.5E-1"), 0.15);
  EXPECT_EQ(read(str_to_real32, "0.25"), 0.25f);
  for (const char* text : {"", "2", "1e5", "2.", ".", "-", "1.0e", "1.0e+", "1.0 ", " 1.0", "1.0x",
                           "0x1.8", "inf", "nan", "1.0.0", "1,5"}) {
    EXPECT_EQ(read(str_to_real64, text), std::nullopt) << text;
    EXPECT_EQ(read(str_to_real32, text), std::nullopt) << text;
  }
}

TEST(StrToReal, BeyondTheRangeIsInfinite) {
  float narrow = 0;
  ASSERT_EQ(str_to_real32("-1.0e300", narrow), 0);
  EXPECT_EQ(narrow, -HUGE_VALF);
  double wide = 0;
  ASSERT_EQ(str_to_real64("1.0e999", wide), 0);
  EXPECT_TRUE(std::isinf(wide));
}

TEST(StrToType, FindsEveryTypeNameInAnyCase) {
  for (std::size_t i = 0; i < NUM_TYPES; ++i) {
    Type type = NONE;
    EXPECT_EQ(str_to_type(type_name_table[i], type), 0);
    EXPECT_EQ(type, static_cast<Type>(i));
  }
  Type type = NONE;
  EXPECT_EQ(str_to_type("DateTime", type), 0);
  EXPECT_EQ(type, DATETIME);
  type = UINT8;
  for (const char* name : {"", "uint", "uint88", "strinG ", "instance"})
    EXPECT_EQ(str_to_type(name, type), -1) << name;
  EXPECT_EQ(type, UINT8);
}

/// Checks one writer on one value against the standard library.
template <class T>
void expect_text(const char* (*writer)(char (&)[NUMBER_TEXT_SIZE], T, std::size_t&), T value) {
  char buffer[NUMBER_TEXT_SIZE];
  std::size_t size = 99;
  const char* text = writer(buffer, value, size);
  EXPECT_EQ(text, std::to_string(value));
  EXPECT_EQ(size, std::strlen(text));
  const bool in_buffer = text >= buffer && text < buffer + sizeof buffer;
  EXPECT_EQ(in_buffer, !(value >= 0 && value <= T{127})) << value;
}

TEST(NumberToStr, SmallNumbersComeFromTheSharedTable) {
  for (std::uint16_t i = 0; i <= 300; ++i) expect_text<std::uint16_t>(uint16_to_str, i);
  for (int i = -128; i <= 127; ++i) expect_text(sint8_to_str, static_cast<std::int8_t>(i));
  for (int i = 0; i <= 255; ++i) expect_text(uint8_to_str, static_cast<std::uint8_t>(i));
}

TEST(NumberToStr, WritesTheWholeRange) {
  expect_text<std::uint32_t>(uint32_to_str, UINT32_MAX);
  expect_text<std::uint64_t>(uint64_to_str, UINT64_MAX);
  expect_text<std::int16_t>(sint16_to_str, INT16_MIN);
  expect_text<std::int32_t>(sint32_to_str, INT32_MIN);
  expect_text<std::int64_t>(sint64_to_str, INT64_MIN);
  expect_text<std::int64_t>(sint64_to_str, INT64_MAX);
}

TEST(NumberToStr, IsTheReverseOfReading) {
  std::mt19937_64 random(3);
  for (int i = 0; i < 2000; ++i) {
    const auto value = static_cast<std::int64_t>(random() >> (random() % 64)) * (i % 2 ? 1 : -1);
    char buffer[NUMBER_TEXT_SIZE];
    std::size_t size = 0;
    EXPECT_EQ(read(str_to_sint64, sint64_to_str(buffer, value, size)), value);
  }
}

TEST(BoundedCopy, CutsAndAnswersTheWantedLength) {
  char place[8];
  EXPECT_EQ(str_lcpy(place, "abc", sizeof place), 3u);
  EXPECT_STREQ(place, "abc");
  EXPECT_EQ(str_lcpy(place, "0123456789", sizeof place), 10u);
  EXPECT_STREQ(place, "0123456");
  EXPECT_EQ(str_lcpy(place, "xyz", 0), 3u);
  EXPECT_STREQ(place, "0123456");
  EXPECT_EQ(str_lcpy(place, "xyz", 1), 3u);
  EXPECT_STREQ(place, "");
}

TEST(BoundedCopy, AppendsWithinThePlace) {
  char place[8] = "abc";
  EXPECT_EQ(str_lcat(place, "de", sizeof place), 5u);
  EXPECT_STREQ(place, "abcde");
  EXPECT_EQ(str_lcat(place, "fghij", sizeof place), 10u);
  EXPECT_STREQ(place, "abcdefg");
  char full[3] = {'x', 'y', 'z'};
  EXPECT_EQ(str_lcat(full, "ab", sizeof full), 5u);
  EXPECT_EQ(full[2], 'z');
}

TEST(FormatAlloc, AnswersABlockOfTheWholeText) {
  char* text = format_alloc("%s-%d", std::string(500, 'a').c_str(), 5);
  ASSERT_NE(text, nullptr);
  EXPECT_EQ(text, std::string(500, 'a') + "-5");
  std::free(text);
}

}  // namespace
}  // namespace cimrt
