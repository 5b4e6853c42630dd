// `tvxcim --sim luns` and `tree` as a person runs them.
#include <nlohmann/json.hpp>

#include "Simulated_Program.h"

namespace tvx::host {
namespace {

using SanProgramTest = test::Simulated_Program;

TEST_F(SanProgramTest, LunsAreATable) {
  const test::Outcome result = run("--sim san-types --strict luns");
  EXPECT_EQ(result.exitCode, 0) << result.err;
  EXPECT_EQ(lines(result.out), 1U + 38) << result.out;
  const char* const top =
      "PORT                     TARGET                   LUN  TYPE            VENDOR    MODEL"
      "        SERIAL        CAPACITY  OS DEVICE\n"
      "10:00:02:54:56:0C:30:01  50:0C:0F:F1:2A:00:10:01  0    disk            ACMESTOR  "
      "ARRAY 7200   AS7292000000  1 GiB     /dev/sda\n"
      "10:00:02:54:56:0C:30:01  50:0C:0F:F1:2A:00:10:01  1    tape            ACMESTOR  "
      "ULTRIUM-TD8  AS7292000001  -         /dev/st1\n";
  EXPECT_EQ(result.out.find(top), 0U) << result.out;
}

TEST_F(SanProgramTest, LunsOfOnePort) {
  const test::Outcome result = run("--sim luns 10:00:02:54:56:0c:41:10");
  EXPECT_EQ(lines(result.out), 9U) << result.out << result.err;
  EXPECT_EQ(result.out.find("10:00:02:54:56:0C:41:11"), std::string::npos) << result.out;
  const test::Outcome none = run("--sim luns 10:00:00:00:00:00:00:99");
  EXPECT_EQ(none.exitCode, 6);
  EXPECT_NE(none.err.find("there is no port '10:00:00:00:00:00:00:99'; the ports are 10:00:02:"),
            std::string::npos)
      << none.err;
  EXPECT_EQ(none.out, "");
  EXPECT_EQ(lines(run("--sim luns 10:00:02:54:56:0A:7E:21").out), 1U) << "a port without units";
}

TEST_F(SanProgramTest, LunsInJson) {
  const auto json = nlohmann::json::parse(run("--sim --json luns").out);
  EXPECT_EQ(json.at("command"), "luns");
  ASSERT_EQ(json.at("luns").size(), 24U);
  const auto& lun = json.at("luns").at(4);
  EXPECT_EQ(lun.at("lun"), "15");
  EXPECT_EQ(lun.at("class"), "TVXHBA_StorageVolume");
  EXPECT_EQ(lun.at("serialNumber"), "AS7200A100000F");
  EXPECT_GT(lun.at("capacity").get<std::uint64_t>(), 1ULL << 43);
  EXPECT_TRUE(json.at("luns").at(5).at("capacity").is_null());
}

TEST_F(SanProgramTest, TreeShowsTheHostWithItsMarks) {
  const test::Outcome result = run("--sim --strict tree");
  EXPECT_EQ(result.exitCode, 0) << result.err;
  EXPECT_EQ(result.out.find("host "), 0U);
  for (const char* line :
       {"\n  + card TVX16002  TX52100417\n",
        "\n    + port 10:00:02:54:56:0C:41:10  16 Gbit/s  OK\n",
        "\n      + target 50:0C:0F:F1:2A:00:10:01  0x010100\n",
        "\n        + LUN 0  disk  ACMESTOR ARRAY 7200  100 GiB  /dev/sda\n",
        "\n  ! card TVX8102  TX48007733\n", "\n    ! port 10:00:02:54:56:0A:7E:21  unknown"}) {
    EXPECT_NE(result.out.find(line), std::string::npos) << line << result.out;
  }
}

TEST_F(SanProgramTest, TreeInJson) {
  const auto tree = nlohmann::json::parse(run("--sim --json tree").out).at("tree");
  ASSERT_EQ(tree.at("cards").size(), 2U);
  const auto& card = tree.at("cards").at(1);
  EXPECT_EQ(card.at("serialNumber"), "TX48007733");
  EXPECT_EQ(card.at("mark"), "!");
  ASSERT_EQ(card.at("ports").size(), 2U);
  EXPECT_EQ(card.at("ports").at(0).at("mark"), "+");
  EXPECT_EQ(card.at("ports").at(0).at("targets").at(1).at("luns").size(), 3U);
  EXPECT_TRUE(card.at("ports").at(1).at("targets").empty());
}

TEST_F(SanProgramTest, HostWithoutAdaptersHasNeither) {
  EXPECT_EQ(run("--sim none luns").out, "no logical units\n");
  EXPECT_EQ(run("--sim none tree").out, "host (no adapters)\n");
}

}  // namespace
}  // namespace tvx::host
