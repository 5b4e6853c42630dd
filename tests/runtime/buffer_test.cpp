#include "runtime/Buffer.h"

#include <gtest/gtest.h>
#include <malloc.h>

#include <cstring>
#include <random>
#include <string>
#include <string_view>

namespace cimrt {
namespace {

std::string_view view(const Buffer& buffer) {
  return buffer.size() == 0 ? std::string_view() : std::string_view(buffer.data(), buffer.size());
}

TEST(Buffer, HoldsNothingAtFirst) {
  const Buffer buffer;
  EXPECT_EQ(buffer.data(), nullptr);
  EXPECT_EQ(buffer.size(), 0u);
  EXPECT_EQ(buffer.capacity(), 0u);
}

TEST(Buffer, ReservingOneByteGivesTheSmallestCapacityAndASpareByte) {
  Buffer buffer;
  buffer.reserve(1);
  EXPECT_EQ(buffer.capacity(), 4096u);
  EXPECT_GE(malloc_usable_size(buffer.data()), 4097u);
  EXPECT_EQ(buffer.size(), 0u);
}

TEST(Buffer, ReserveIsExactAboveTheSmallestCapacity) {
  Buffer buffer;
  buffer.reserve(5000);
  EXPECT_EQ(buffer.capacity(), 5000u);
  buffer.reserve(4999);
  EXPECT_EQ(buffer.capacity(), 5000u);
}

TEST(Buffer, InsertThatDoesNotFitTakesTheNextPowerOfTwo) {
  Buffer buffer;
  buffer.append("x", 1);
  EXPECT_EQ(buffer.capacity(), 4096u);
  const std::string block(5000, 'b');
  buffer.insert(0, block.data(), block.size());
  EXPECT_EQ(buffer.capacity(), 8192u);
  EXPECT_EQ(view(buffer), block + "x");
}

TEST(Buffer, InsertPutsBytesInFrontOfThePosition) {
  Buffer buffer;
  buffer.append("adef", 4);
  buffer.insert(1, "bc", 2);
  EXPECT_EQ(view(buffer), "abcdef");
  buffer.insert(100, "!", 1);
  EXPECT_EQ(view(buffer), "abcdef!");
  buffer.insert(0, nullptr, 0);
  EXPECT_EQ(view(buffer), "abcdef!");
}

TEST(Buffer, InsertOfItsOwnBytesTakesThemAsTheyWere) {
  Buffer buffer;
  buffer.append("abcd", 4);
  buffer.insert(1, buffer.data(), 4);
  EXPECT_EQ(view(buffer), "aabcdbcd");
}

TEST(Buffer, RemoveTakesOutWhatIsThere) {
  Buffer buffer;
  buffer.append("0123456789", 10);
  buffer.remove(2, 3);
  EXPECT_EQ(view(buffer), "0156789");
  buffer.remove(5, 100);
  EXPECT_EQ(view(buffer), "01567");
  buffer.remove(5, 1);
  EXPECT_EQ(view(buffer), "01567");
}

TEST(Buffer, GrowDoublesAndStartsAtTheSmallestCapacity) {
  Buffer buffer;
  buffer.grow();
  EXPECT_EQ(buffer.capacity(), 4096u);
  buffer.grow();
  EXPECT_EQ(buffer.capacity(), 8192u);
}

TEST(Buffer, CopiesAreDeepAndOfExactSize) {
  Buffer buffer;
  buffer.append("abc", 3);
  const Buffer copy(buffer);
  Buffer assigned;
  assigned.append("something else", 14);
  assigned = buffer;
  buffer.data()[0] = 'X';
  EXPECT_EQ(view(copy), "abc");
  EXPECT_EQ(copy.capacity(), 3u);
  EXPECT_EQ(view(assigned), "abc");
  EXPECT_EQ(assigned.capacity(), 3u);
  const Buffer& self = assigned;
  assigned = self;
  EXPECT_EQ(view(assigned), "abc");
  EXPECT_EQ(Buffer(Buffer()).data(), nullptr);
}

TEST(Buffer, AppendsNumbersInDecimal) {
  Buffer buffer;
  buffer.append_uint16(0);
  buffer.append(' ');
  buffer.append_uint16(65535);
  buffer.append(' ');
  buffer.append_uint32(4294967295u);
  buffer.append(' ');
  buffer.append_uint64(18446744073709551615u);
  EXPECT_EQ(view(buffer), "0 65535 4294967295 18446744073709551615");
}

TEST(Buffer, FormatAppendsWithoutANul) {
  Buffer buffer;
  buffer.append("[", 1);
  buffer.format("%s %d", "text", -5);
  EXPECT_EQ(view(buffer), "[text -5");
  EXPECT_STREQ(buffer.c_str(), "[text -5");
}

TEST(Buffer, FormatFitsTextsAroundAndFarAboveTheFirstGuess) {
  for (const std::size_t n : {126u, 127u, 128u, 129u, 130u, 10000u}) {
    Buffer buffer;
    buffer.append("x", 1);
    buffer.format("%s|%zu", std::string(n, 'a').c_str(), n);
    EXPECT_EQ(view(buffer), "x" + std::string(n, 'a') + "|" + std::to_string(n));
  }
}

TEST(Buffer, FormatOfWhatCannotBeFormattedAppendsNothing) {
  Buffer buffer;
  buffer.append("x", 1);
  const wchar_t not_a_character[] = {static_cast<wchar_t>(0x7FFFFFFF), 0};
  buffer.format("%ls", not_a_character);
  EXPECT_EQ(view(buffer), "x");
}

TEST(Buffer, CStrOfAnEmptyBufferIsTheEmptyText) {
  Buffer buffer;
  EXPECT_STREQ(buffer.c_str(), "");
}

class Buffer_Property : public testing::TestWithParam<unsigned> {};

TEST_P(Buffer_Property, RandomOperationsMatchTheStandardString) {
  std::mt19937 random(GetParam());
  const auto below = [&](std::size_t n) { return random() % n; };
  Buffer buffer;
  std::string model;
  for (int step = 0; step < 2000; ++step) {
    const std::size_t pos = below(model.size() + 1);
    const std::string text(below(300), static_cast<char>('a' + below(26)));
    switch (below(6)) {
      case 0:
        buffer.insert(pos, text.data(), text.size());
        model.insert(pos, text);
        break;
      case 1:
        buffer.append('x');
        model += 'x';
        break;
      case 2: {
        const std::size_t n = below(400);
        buffer.remove(pos, n);
        model.erase(pos, n);
        break;
      }
      case 3: {
        const auto n = static_cast<std::uint32_t>(random());
        buffer.append_uint32(n);
        model += std::to_string(n);
        break;
      }
      case 4:
        buffer.format("<%s>", text.c_str());
        model += "<" + text + ">";
        break;
      default: {
        const Buffer copy(buffer);
        buffer = copy;
        break;
      }
    }
    ASSERT_EQ(view(buffer), model);
    ASSERT_GE(buffer.capacity(), buffer.size());
  }
}

INSTANTIATE_TEST_SUITE_P(Seeds, Buffer_Property, testing::Values(1u, 2u, 3u));

}  // namespace
}  // namespace cimrt
