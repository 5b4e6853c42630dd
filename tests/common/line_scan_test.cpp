#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <fstream>
#include <string>
#include <vector>

#include "common/TVX_Line_Scan.h"
#include "support/Temp_Root.h"

namespace {

using cimrt::TVX_SCANNED_LINE;
using cimrt::tvxLastLinesWith;

class Line_Scan : public testing::Test {
 protected:
  std::vector<std::string> scan(std::size_t limit = 200) const {
    const auto lines = tvxLastLinesWith(root.path("/var/log/messages").c_str(), "tvfc", limit);
    return {lines.begin(), lines.end()};
  }
  std::vector<std::string> scanText(std::string_view text, std::size_t limit = 200) const {
    root.write("/var/log/messages", text);
    return scan(limit);
  }
  using Lines = std::vector<std::string>;

  const tvx::test::Temp_Root root;
};

TEST_F(Line_Scan, KeepsLinesWithTheWordInFileOrder) {
  EXPECT_EQ(scanText("tvfc\nother\nxtvfcx \n\ntv fc\n  tvfc 0:1\r\n"),
            (Lines{"tvfc", "xtvfcx ", "  tvfc 0:1\r"}));
}

TEST_F(Line_Scan, TheLastLineNeedsNoLineFeed) {
  EXPECT_EQ(scanText("a\ntvfc at the end"), (Lines{"tvfc at the end"}));
}

TEST_F(Line_Scan, KeepsTheLastOnesUpToTheLimit) {
  EXPECT_EQ(scanText("tvfc 1\ntvfc 2\ntvfc 3\n", 2), (Lines{"tvfc 2", "tvfc 3"}));
  EXPECT_EQ(scanText("tvfc 1\n", 0), Lines());
}

TEST_F(Line_Scan, WhatIsNoRegularFileHasNoLines) {
  EXPECT_EQ(scan(), Lines()) << "no file at all";
  EXPECT_EQ(scanText(""), Lines());
  EXPECT_TRUE(tvxLastLinesWith(root.path("/var/log").c_str(), "tvfc", 9).empty());
  EXPECT_TRUE(tvxLastLinesWith("/dev/zero", "tvfc", 9).empty()) << "it never ends";
  const std::string pipe = root.path("/var/log/pipe");
  ASSERT_EQ(::mkfifo(pipe.c_str(), 0600), 0);
  EXPECT_TRUE(tvxLastLinesWith(pipe.c_str(), "tvfc", 9).empty()) << "nobody writes into it";
}

TEST_F(Line_Scan, AFileThatMayNotBeReadHasNoLines) {
  root.write("/var/log/messages", "tvfc\n");
  const std::string path = root.path("/var/log/messages");
  ASSERT_EQ(::chmod(path.c_str(), 0), 0);
  constexpr uid_t NOBODY = 65534;
  const uid_t user = ::geteuid();
  if (user == 0) {
    ASSERT_EQ(::seteuid(NOBODY), 0);
  }
  const bool isEmpty = scan().empty();
  const int restored = ::seteuid(user);
  ASSERT_EQ(restored, 0);
  EXPECT_TRUE(isEmpty);
  ASSERT_EQ(::chmod(path.c_str(), 0600), 0);
  EXPECT_EQ(scan(), Lines{"tvfc"});
}

TEST_F(Line_Scan, BinaryBytesStayAndZeroBytesGo) {
  using namespace std::string_view_literals;
  EXPECT_EQ(scanText("\0\0\0tvfc \xff\xfe\x01\x7f end\0\n\0\0\n\0tv\0fc\n"sv),
            (Lines{"tvfc \xff\xfe\x01\x7f end"}));
}

TEST_F(Line_Scan, OfALineWithoutEndOnlyTheBeginningIsKept) {
  const std::string filler(3'000'000, 'x');
  // The word lies far behind what is kept.
  const Lines lines = scanText(filler + "tvfc" + filler + "\ntvfc\n" + filler);
  ASSERT_EQ(lines.size(), 2U);
  EXPECT_EQ(lines[0], std::string(TVX_SCANNED_LINE, 'x'));
  EXPECT_EQ(lines[1], "tvfc");
}

TEST_F(Line_Scan, TheWordIsFoundWhereverAReadEnds) {
  // Reads end at multiples of a power of two; the word stands across each of these ends once.
  for (const std::size_t end :
       {std::size_t{4096}, std::size_t{65536}, std::size_t{262144}, std::size_t{524288}})
    for (std::size_t before = 1; before < 4; before++) {
      const std::string text = std::string(end - before, 'x') + "tvfc" + "\nnext\n";
      EXPECT_EQ(scanText(text).size(), 1U) << end << " " << before;
      EXPECT_EQ(scanText("\n" + text).size(), 1U);
    }
  EXPECT_EQ(scanText(std::string(262144 - 2, 'x') + "tv\nfc\n").size(), 0U)
      << "the line feed is no part of the word";
}

TEST_F(Line_Scan, AMillionLinesAreReadToTheEnd) {
  {
    std::ofstream out(root.path("/var/log/messages"), std::ios::binary);
    std::string block;
    for (int i = 0; i < 1000; i++)
      block += i % 100 == 99 ? "Nov 21 06:00:00 host kernel: tvfc 0: event\n"
                             : "Nov 21 06:00:00 host kernel: something else\n";
    for (int i = 0; i < 999; i++) out << block;
    for (int i = 0; i < 999; i++) out << "Nov 21 07:00:00 host kernel: later\n";
    out << "the last line is of tvfc";
  }
  const Lines lines = scan();
  ASSERT_EQ(lines.size(), 200U);
  EXPECT_EQ(lines.back(), "the last line is of tvfc");
  EXPECT_EQ(lines.front(), "Nov 21 06:00:00 host kernel: tvfc 0: event");
}

}  // namespace
