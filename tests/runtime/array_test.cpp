#include "runtime/Array.h"

#include <gtest/gtest.h>

#include <cmath>
#include <random>
#include <string>
#include <vector>

#include "Test_Schema.h"
#include "runtime/Datetime.h"
#include "runtime/String.h"

namespace cimrt {
namespace {

constexpr std::size_t NOT_FOUND = static_cast<std::size_t>(-1);

TEST(Array, StartsEmptyWithRoomForEight) {
  const Array<std::uint32_t> array;
  EXPECT_EQ(array.size(), 0u);
  EXPECT_EQ(array.capacity(), 8u);
}

TEST(Array, ConstructionFromDataIsExact) {
  const std::uint16_t data[] = {1, 2, 3};
  const Array<std::uint16_t> array(data, 3);
  EXPECT_EQ(array.size(), 3u);
  EXPECT_EQ(array.capacity(), 3u);
  EXPECT_EQ(array[2], 3u);
}

TEST(Array, CapacityGrowsExactlyBeyondTheFirstEight) {
  Array<std::uint8_t> array;
  for (std::uint8_t i = 0; i < 8; ++i) array.append(i);
  EXPECT_EQ(array.capacity(), 8u);
  array.append(8);
  EXPECT_EQ(array.capacity(), 9u);
  array.append(9);
  EXPECT_EQ(array.capacity(), 10u);
  array.reserve(100);
  EXPECT_EQ(array.capacity(), 100u);
  array.reserve(50);
  EXPECT_EQ(array.capacity(), 100u);
  array.clear();
  EXPECT_EQ(array.capacity(), 100u);
}

TEST(Array, CopiesAreDeep) {
  Array<String> a{"one", "two"};
  const Array<String> b(a);
  Array<String> c;
  c = a;
  a[0].assign("changed");
  EXPECT_STREQ(b[0].c_str(), "one");
  EXPECT_STREQ(c[0].c_str(), "one");
  const Array<String>& self = c;
  c = self;
  EXPECT_EQ(c.size(), 2u);
}

TEST(Array, CopiesOfNothingTakeNoRoomUntilSomethingComesIn) {
  const Array<String> nothing;
  Array<String> a(nothing);
  Array<String> b(nullptr, 0);
  EXPECT_EQ(a.capacity(), 0u);
  EXPECT_EQ(a.element(0), b.element(0));
  a.clear();
  a.resize(0, String());
  EXPECT_TRUE(a.equal(nothing));
  a.append("one");
  EXPECT_EQ(a.capacity(), 1u);
  EXPECT_EQ(b.size(), 0u);
  b.resize(2, String("two"));
  EXPECT_EQ(b[1], "two");
  EXPECT_EQ(a[0], "one");
  a = nothing;
  EXPECT_EQ(a.capacity(), 0u);
  a.prepend("three");
  EXPECT_EQ(a[0], "three");
}

TEST(Array, CopiedStringsShareTheirRep) {
  const Array<String> a{"one"};
  const Array<String> b(a);
  EXPECT_EQ(a[0].rep(), b[0].rep());
}

TEST(Array, InsertPrependAndAppendKeepTheOrder) {
  Array<String> array;
  array.append("c");
  array.prepend("a");
  array.insert(1, String("b"));
  array.insert(100, String("d"));
  ASSERT_EQ(array.size(), 4u);
  std::string all;
  for (const String& s : array) all += s.c_str();
  EXPECT_EQ(all, "abcd");
}

TEST(Array, InsertOfItsOwnElementsTakesThemAsTheyWere) {
  Array<String> strings{"a", "b"};
  strings.append(strings[0]);
  strings.insert(0, strings.begin(), 3);
  std::string all;
  for (const String& s : strings) all += s.c_str();
  EXPECT_EQ(all, "abaaba");
  Array<std::uint32_t> numbers{1, 2, 3, 4, 5, 6, 7, 8};
  numbers.append(numbers[7]);
  EXPECT_EQ(numbers[8], 8u);
  strings.resize(50, strings[1]);
  EXPECT_STREQ(strings[49].c_str(), "b");
}

TEST(Array, RemoveReleasesTheElements) {
  const String text("shared text");
  Array<String> array;
  for (int i = 0; i < 4; ++i) array.append(text);
  EXPECT_EQ(text.rep()->refs.load(), 5u);
  Array_Base& base = array;
  base.remove(1, 2);
  EXPECT_EQ(text.rep()->refs.load(), 3u);
  base.remove(1, 100);
  EXPECT_EQ(array.size(), 1u);
  base.remove(7, 1);
  EXPECT_EQ(array.size(), 1u);
}

TEST(Array, ResizingPlainElementsFillsWithZerosWhateverTheFill) {
  Array<std::uint32_t> array{1, 2};
  array.resize(4, 7);
  ASSERT_EQ(array.size(), 4u);
  EXPECT_EQ(array[1], 2u);
  EXPECT_EQ(array[2], 0u);
  EXPECT_EQ(array[3], 0u);
}

TEST(Array, ResizingStringsCopiesTheFill) {
  Array<String> array{"a", "b"};
  const String fill("fill");
  array.resize(4, fill);
  ASSERT_EQ(array.size(), 4u);
  EXPECT_STREQ(array[2].c_str(), "fill");
  EXPECT_STREQ(array[3].c_str(), "fill");
  EXPECT_EQ(fill.rep()->refs.load(), 3u);
  array.resize(1, fill);
  EXPECT_EQ(array.size(), 1u);
  EXPECT_EQ(fill.rep()->refs.load(), 1u);
}

TEST(Array, FindOfPlainElementsAnswersOneWhateverTheIndex) {
  const Array<std::uint16_t> array{9, 8, 7, 6, 5, 4};
  EXPECT_EQ(array.find(4), 1u);
  EXPECT_EQ(array.find(9), 1u);
  EXPECT_EQ(array.find(3), NOT_FOUND);
}

TEST(Array, FindOfStringsRealsAndDatetimesAnswersTheIndex) {
  const Array<String> strings{"a", "b", "c", "b"};
  EXPECT_EQ(strings.find("b"), 1u);
  EXPECT_EQ(strings.find("c"), 2u);
  EXPECT_EQ(strings.find("C"), NOT_FOUND);
  const Array<double> reals{1.0, 2.0, -0.0};
  EXPECT_EQ(reals.find(0.0), 2u);
  const Array<Datetime> datetimes{Datetime(1), Datetime(2, 0), Datetime(2)};
  EXPECT_EQ(datetimes.find(Datetime(2)), 2u);
}

TEST(Array, EqualComparesSizesAndElements) {
  EXPECT_TRUE((Array<std::uint32_t>{1, 2}).equal(Array<std::uint32_t>{1, 2}));
  EXPECT_FALSE((Array<std::uint32_t>{1, 2}).equal(Array<std::uint32_t>{1, 3}));
  EXPECT_FALSE((Array<std::uint32_t>{1, 2}).equal(Array<std::uint32_t>{1}));
  EXPECT_TRUE((Array<String>{"a"}).equal(Array<String>{"a"}));
  EXPECT_FALSE((Array<String>{"a"}).equal(Array<String>{"A"}));
  EXPECT_TRUE((Array<float>{0.0f}).equal(Array<float>{-0.0f}));
  EXPECT_FALSE((Array<float>{std::nanf("")}).equal(Array<float>{std::nanf("")}));
  EXPECT_TRUE(Array<String>().equal(Array<String>()));
}

TEST(Array, TraitsHaveTheWidthOfEachType) {
  for (std::size_t i = 0; i < NUM_TYPES; ++i) {
    EXPECT_EQ(array_traits[i]->size, type_size_table[i]) << type_name_table[i];
    const bool is_object = i == STRING || i == DATETIME;
    EXPECT_EQ(array_traits[i]->construct != nullptr, is_object) << type_name_table[i];
    EXPECT_EQ(array_traits[i]->destroy != nullptr, is_object) << type_name_table[i];
    EXPECT_EQ(array_traits[i]->equal != nullptr, is_object || i == REAL32 || i == REAL64)
        << type_name_table[i];
  }
  EXPECT_EQ(instance_array_traits.size, sizeof(void*));
  EXPECT_EQ(instance_array_traits.construct, nullptr);
}

TEST(Array, OfInstancesHoldsBarePointers) {
  const Ref<test::T_Device> device = test::make_device("a", 1);
  {
    Array<Instance*> array;
    array.append(device.get());
    const Array<Instance*> copy(array);
    EXPECT_EQ(copy[0], device.get());
  }
  EXPECT_EQ(device->refs.load(), 1u);
}

TEST(Types, NamesAndWidthsStandInTheOrderOfTheCodes) {
  const char* const names[] = {"boolean", "uint8",  "sint8",  "uint16",  "sint16",
                               "uint32",  "sint32", "uint64", "sint64",  "real32",
                               "real64",  "char16", "string", "datetime"};
  const std::size_t sizes[] = {1, 1, 1, 2, 2, 4, 4, 8, 8, 4, 8, 2, 8, 8};
  for (std::size_t i = 0; i < NUM_TYPES; ++i) {
    EXPECT_STREQ(type_name_table[i], names[i]);
    EXPECT_EQ(type_size_table[i], sizes[i]);
  }
}

TEST(Types, LowerFoldsAsciiLettersOnly) {
  for (int c = 0; c < 256; ++c) EXPECT_EQ(__lower[c], c >= 'A' && c <= 'Z' ? c + 32 : c);
}

TEST(Types, NamesAreEqualIgnoringCase) {
  EXPECT_TRUE(name_eq("InstanceID", "instanceid"));
  EXPECT_FALSE(name_eq("InstanceID", "instanceids"));
  EXPECT_FALSE(name_eq("a", "b"));
  EXPECT_FALSE(name_eq("", "b"));
  EXPECT_TRUE(name_eq("", ""));
}

class Array_Property : public testing::TestWithParam<unsigned> {};

/// Runs random operations on an array and a vector; `make` turns a number into an element.
template <class T, class Make>
void match_vector(unsigned seed, bool resize_copies, Make make) {
  std::mt19937 random(seed);
  const auto below = [&](std::size_t n) { return random() % n; };
  Array<T> array;
  std::vector<T> model;
  for (int step = 0; step < 1500; ++step) {
    const std::size_t pos = below(model.size() + 1);
    const T item = make(below(1000));
    switch (below(6)) {
      case 0:
        array.append(item);
        model.push_back(item);
        break;
      case 1: {
        const std::vector<T> items(below(5), item);
        array.insert(pos, items.data(), items.size());
        model.insert(model.begin() + static_cast<std::ptrdiff_t>(pos), items.begin(), items.end());
        break;
      }
      case 2: {
        const std::size_t n = std::min(below(6), model.size() - pos);
        static_cast<Array_Base&>(array).remove(pos, n);
        const auto first = model.begin() + static_cast<std::ptrdiff_t>(pos);
        model.erase(first, first + static_cast<std::ptrdiff_t>(n));
        break;
      }
      case 3: {
        const std::size_t n = below(40);
        array.resize(n, item);
        model.resize(n, resize_copies ? item : make(0));
        break;
      }
      case 4: {
        const Array<T> copy(array);
        array = copy;
        break;
      }
      default:
        array.prepend(item);
        model.insert(model.begin(), item);
        break;
    }
    ASSERT_EQ(array.size(), model.size());
    for (std::size_t i = 0; i < model.size(); ++i) ASSERT_TRUE(array[i] == model[i]);
    ASSERT_TRUE(array.equal(Array<T>(model.data(), model.size())));
  }
}

TEST_P(Array_Property, RandomOperationsOnNumbersMatchTheStandardVector) {
  match_vector<std::uint32_t>(GetParam(), false, [](std::size_t n) { return std::uint32_t(n); });
}

TEST_P(Array_Property, RandomOperationsOnStringsMatchTheStandardVector) {
  match_vector<String>(GetParam(), true,
                       [](std::size_t n) { return String(std::to_string(n).c_str()); });
}

TEST_P(Array_Property, RandomOperationsOnDatetimesMatchTheStandardVector) {
  match_vector<Datetime>(GetParam(), true, [](std::size_t n) { return Datetime(n); });
}

INSTANTIATE_TEST_SUITE_P(Seeds, Array_Property, testing::Values(1u, 2u, 3u));

}  // namespace
}  // namespace cimrt
