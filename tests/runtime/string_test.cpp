#include "runtime/String.h"

#include <gtest/gtest.h>

#include <random>
#include <string>

namespace cimrt {
namespace {

TEST(String, DefaultAndEmptyTextsShareTheEmptyRep) {
  const String from_nothing;
  const String from_text("");
  const String from_length("abc", std::size_t{0});
  const String from_null(static_cast<const char*>(nullptr));
  EXPECT_EQ(from_nothing.rep(), String::empty_rep());
  EXPECT_EQ(from_text.rep(), String::empty_rep());
  EXPECT_EQ(from_length.rep(), String::empty_rep());
  EXPECT_EQ(from_null.rep(), String::empty_rep());
}

TEST(String, EmptyRepIsNeverCounted) {
  const std::uint32_t before = String::empty_rep()->refs.load();
  EXPECT_EQ(before, 2u);
  {
    String a;
    String b(a);
    String c;
    c = b;
    EXPECT_EQ(String::empty_rep()->refs.load(), before);
  }
  EXPECT_EQ(String::empty_rep()->refs.load(), before);
  EXPECT_EQ(String::empty_rep()->size, 0u);
  EXPECT_EQ(String::empty_rep()->cap, 0u);
  EXPECT_STREQ(String().c_str(), "");
}

TEST(String, CapacityIs32BelowThatAndElseAPowerOfTwo) {
  EXPECT_EQ(String("x").capacity(), 32u);
  EXPECT_EQ(String(std::string(31, 'x')).capacity(), 32u);
  EXPECT_EQ(String(std::string(32, 'x')).capacity(), 32u);
  EXPECT_EQ(String(std::string(33, 'x')).capacity(), 64u);
  EXPECT_EQ(String(std::string(64, 'x')).capacity(), 64u);
  EXPECT_EQ(String(std::string(1000, 'x')).capacity(), 1024u);
}

TEST(String, AppendingSingleCharactersGoesFromEmptyTo32To64) {
  String s;
  EXPECT_EQ(s.capacity(), 0u);
  s.append('a');
  EXPECT_EQ(s.capacity(), 32u);
  for (int i = 1; i < 32; ++i) s.append('a');
  EXPECT_EQ(s.capacity(), 32u);
  s.append('b');
  EXPECT_EQ(s.capacity(), 64u);
  EXPECT_EQ(s.view(), std::string(32, 'a') + "b");
}

TEST(String, AppendingACharacterToASharedRepDoublesItsCapacity) {
  String a("abc");
  const String b(a);
  a.append('d');
  EXPECT_EQ(a.capacity(), 64u);
  EXPECT_STREQ(a.c_str(), "abcd");
  EXPECT_STREQ(b.c_str(), "abc");
  EXPECT_EQ(b.capacity(), 32u);
}

TEST(String, CopiesShareTheRep) {
  const String a("abc");
  const String b(a);
  String c;
  c.assign(a);
  EXPECT_EQ(a.rep(), b.rep());
  EXPECT_EQ(a.rep(), c.rep());
  EXPECT_EQ(a.rep()->refs.load(), 3u);
}

TEST(String, MovingLeavesTheEmptyRepBehind) {
  String a("abc");
  const StringRep* rep = a.rep();
  const String b(std::move(a));
  EXPECT_EQ(b.rep(), rep);
  EXPECT_EQ(a.rep(),
            String::empty_rep());  // NOLINT: the state behind a move is part of the contract
}

TEST(String, AssigningATextToOneCopyLeavesTheOtherAndTakesANewRep) {
  String a("a long enough text");
  const String b(a);
  a.assign("xy");
  EXPECT_STREQ(a.c_str(), "xy");
  EXPECT_STREQ(b.c_str(), "a long enough text");
  EXPECT_NE(a.rep(), b.rep());
}

TEST(String, AssigningATextReusesAPrivateRepThatIsLargeEnough) {
  String a(std::string(60, 'x'));
  const StringRep* rep = a.rep();
  a.assign("short");
  EXPECT_EQ(a.rep(), rep);
  EXPECT_EQ(a.capacity(), 64u);
  a.assign("");
  EXPECT_EQ(a.rep(), rep);
  a.assign(std::string(65, 'y').c_str());
  EXPECT_EQ(a.capacity(), 128u);
  EXPECT_EQ(a.size(), 65u);
}

TEST(String, AssigningAPartOfItselfKeepsThatPart) {
  String a("0123456789");
  a.assign(a.c_str() + 3, 4);
  EXPECT_STREQ(a.c_str(), "3456");
  a = a.c_str() + 1;
  EXPECT_STREQ(a.c_str(), "456");
}

TEST(String, ClearingASharedRepGoesToTheEmptyRepAndAPrivateOneKeepsIt) {
  String a("abc");
  {
    const String b(a);
    a.clear();
    EXPECT_EQ(a.rep(), String::empty_rep());
    EXPECT_STREQ(b.c_str(), "abc");
  }
  String c("abc");
  const StringRep* rep = c.rep();
  c.clear();
  EXPECT_EQ(c.rep(), rep);
  EXPECT_EQ(c.size(), 0u);
  EXPECT_EQ(c.capacity(), 32u);
  EXPECT_STREQ(c.c_str(), "");
}

TEST(String, ReserveKeepsTheTextAndMakesTheRepPrivate) {
  String a("abc");
  const String b(a);
  a.reserve(2);
  EXPECT_NE(a.rep(), b.rep());
  EXPECT_STREQ(a.c_str(), "abc");
  const StringRep* rep = a.rep();
  a.reserve(32);
  EXPECT_EQ(a.rep(), rep);
  a.reserve(100);
  EXPECT_EQ(a.capacity(), 128u);
  EXPECT_STREQ(a.c_str(), "abc");
}

TEST(String, AppendingABlockTakesTheCapacityOfTheNewLength) {
  String a("abc");
  a.append(std::string(40, 'x').c_str());
  EXPECT_EQ(a.capacity(), 64u);
  EXPECT_EQ(a.size(), 43u);
  a.append(a);
  EXPECT_EQ(a.size(), 86u);
  EXPECT_EQ(a.capacity(), 128u);
  EXPECT_EQ(a.substr(0, 43).view(), a.substr(43).view());
}

TEST(String, ConcatenatesTwoOrThreeTexts) {
  EXPECT_STREQ(String("ab", "cd").c_str(), "abcd");
  EXPECT_STREQ(String("ab", "", "ef").c_str(), "abef");
  EXPECT_STREQ(String("", "").c_str(), "");
}

TEST(String, RemoveTakesOutTheMiddleOrTheRest) {
  String a("0123456789");
  const String b(a);
  a.remove(2, 3);
  EXPECT_STREQ(a.c_str(), "0156789");
  a.remove(3);
  EXPECT_STREQ(a.c_str(), "015");
  a.remove(1, 100);
  EXPECT_STREQ(a.c_str(), "0");
  a.remove(7, 1);
  EXPECT_STREQ(a.c_str(), "0");
  EXPECT_STREQ(b.c_str(), "0123456789");
}

TEST(String, SetChangesOneCharacterOfAPrivateCopy) {
  String a(std::string(100, 'x'));
  const String b(a);
  a.set(1, 'y');
  a.set(1000, 'z');
  EXPECT_EQ(a[1], 'y');
  EXPECT_EQ(b[1], 'x');
  EXPECT_EQ(a.capacity(), 128u);
  EXPECT_EQ(a.size(), 100u);
}

TEST(String, SubstrTakesAPartOrTheRest) {
  const String a("0123456789");
  EXPECT_STREQ(a.substr(3, 4).c_str(), "3456");
  EXPECT_STREQ(a.substr(7).c_str(), "789");
  EXPECT_STREQ(String(a, 2, 2).c_str(), "23");
  EXPECT_EQ(a.substr(10).rep(), String::empty_rep());
  EXPECT_EQ(a.substr(11, 5).rep(), String::empty_rep());
}

TEST(String, FindAnswersThePositionOrNpos) {
  const String a("one two one");
  EXPECT_EQ(a.find("one"), 0u);
  EXPECT_EQ(a.find(String("two")), 4u);
  EXPECT_EQ(a.find("six"), String::npos);
  EXPECT_EQ(a.find('t'), 4u);
  EXPECT_EQ(a.find('o', 1), 6u);
  EXPECT_EQ(a.find('o', 9), String::npos);
  EXPECT_EQ(a.find('o', 100), String::npos);
  EXPECT_EQ(a.find(""), 0u);
}

TEST(String, EqualComparesSizeAndBytes) {
  const String a("abc");
  EXPECT_TRUE(a.equal(String("abc")));
  EXPECT_FALSE(a.equal(String("abC")));
  EXPECT_FALSE(a.equal(String("abcd")));
  EXPECT_TRUE(a.equal("abc"));
  EXPECT_FALSE(a.equal("ab"));
  EXPECT_TRUE(a.equal("abcdef", 3));
  EXPECT_FALSE(a.equal("abcdef", 4));
  EXPECT_TRUE(String("x").equal('x'));
  EXPECT_FALSE(a.equal('a'));
  EXPECT_FALSE(String("ab\0cd", 5).equal(String("ab\0ce", 5)));
  EXPECT_TRUE(a == "abc");
  EXPECT_TRUE(a == String("abc"));
}

TEST(String, EqualiIgnoresCase) {
  const String a("InstanceID");
  EXPECT_TRUE(a.equali(String("instanceid")));
  EXPECT_FALSE(a.equali(String("instanceids")));
  EXPECT_TRUE(a.equali("INSTANCEID"));
  EXPECT_FALSE(a.equali("xnstanceid"));
  EXPECT_TRUE(a.equali("instanceid and more", 10));
  EXPECT_FALSE(a.equali("instanceid and more", 9));
  EXPECT_TRUE(String().equali(""));
}

/// One `String` and the `std::string` that it must equal.
struct Pair {
  String ours;
  std::string model;
};

class String_Property : public testing::TestWithParam<unsigned> {};

TEST_P(String_Property, RandomOperationsMatchTheStandardString) {
  std::mt19937 random(GetParam());
  const auto below = [&](std::size_t n) { return random() % n; };
  Pair pairs[4];
  for (int step = 0; step < 3000; ++step) {
    Pair& p = pairs[below(4)];
    const Pair& q = pairs[below(4)];
    const std::string text(below(50), static_cast<char>('a' + below(26)));
    const std::size_t pos = below(p.model.size() + 1);
    switch (below(9)) {
      case 0:
        p.ours.assign(text.c_str());
        p.model = text;
        break;
      case 1:
        p.ours.append('x');
        p.model += 'x';
        break;
      case 2:
        p.ours.append(text.data(), text.size());
        p.model += text;
        break;
      case 3:
        p.ours.assign(q.ours);
        p.model = q.model;
        break;
      case 4: {
        const std::size_t n = below(20);
        p.ours.remove(pos, n);
        p.model.erase(pos, n);
        break;
      }
      case 5:
        if (pos < p.model.size()) {
          p.ours.set(pos, '!');
          p.model[pos] = '!';
        }
        break;
      case 6:
        if (p.model.size() < 4000) {
          p.ours.append(q.ours);
          p.model += std::string(q.model);
        }
        break;
      case 7:
        p.ours = p.ours.substr(pos, 30);
        p.model = p.model.substr(pos, 30);
        break;
      default:
        p.ours.reserve(below(200));
        break;
    }
    if (step % 100 == 99) {
      p.ours.clear();
      p.model.clear();
    }
    for (const Pair& pair : pairs) {
      ASSERT_EQ(pair.ours.view(), pair.model);
      ASSERT_EQ(pair.ours.c_str()[pair.model.size()], '\0');
      ASSERT_GE(pair.ours.capacity(), pair.ours.size());
    }
    ASSERT_EQ(p.ours.find('!'), p.model.find('!'));
    ASSERT_EQ(p.ours.equal(q.ours), p.model == q.model);
  }
}

INSTANTIATE_TEST_SUITE_P(Seeds, String_Property, testing::Values(1u, 2u, 3u, 4u));

}  // namespace
}  // namespace cimrt
