// tvxcim --sim as a person runs it: the built program, the built provider, simulated adapters.
#include <nlohmann/json.hpp>

#include "Simulated_Program.h"

namespace tvx::host {
namespace {

namespace fs = std::filesystem;

using SimulationTest = test::Simulated_Program;

TEST_F(SimulationTest, PortsShowsTheFourPortsOfTheDefaultHost) {
  const test::Outcome result = run("--sim ports");
  EXPECT_EQ(result.exitCode, 0) << result.err;
  EXPECT_EQ(lines(result.out), 5U) << result.out;
  EXPECT_NE(result.out.find("16 Gbit/s  OK"), std::string::npos) << result.out;
  EXPECT_EQ(run("--sim ports").out, result.out) << "a second run shows the same";
  EXPECT_EQ(run("--sim default ports").out, result.out);
}

TEST_F(SimulationTest, PortsAreJsonToo) {
  const auto json = nlohmann::json::parse(run("ports --json --sim").out);
  EXPECT_EQ(json["version"], 1);
  ASSERT_EQ(json["ports"].size(), 4U);
  EXPECT_EQ(json["ports"][0]["speed"], 16000000000);
  EXPECT_FALSE(json["ports"][0]["serialNumber"].get<std::string>().empty());
  EXPECT_FALSE(json["ports"][0]["model"].get<std::string>().empty());
}

TEST_F(SimulationTest, TheMachinesOwnFoldersAreNotUsed) {
  run("--sim ports");
  ASSERT_FALSE(fs::is_empty(m_Temporary));
  const fs::path root = fs::directory_iterator(m_Temporary)->path();
  EXPECT_TRUE(fs::is_directory(root / "var/log")) << root;
}

TEST_F(SimulationTest, ARootOfTheUsersChoiceIsUsed) {
  const fs::path root = m_Temporary / "mine";
  fs::create_directories(root / "etc");
  EXPECT_EQ(run("--sim --root " + root.string() + " ports").exitCode, 0);
  EXPECT_EQ(std::distance(fs::directory_iterator(m_Temporary), {}), 1) << "no other folder is made";
}

TEST_F(SimulationTest, ScenariosAreFoundByName) {
  EXPECT_EQ(run("--sim none ports").out, "no FC ports\n");
  EXPECT_EQ(lines(run("--sim=single ports").out), 2U) << run("--sim=single ports").out;
  const test::Outcome unknown = run("--sim nosuch ports");
  EXPECT_EQ(unknown.exitCode, 10);
  EXPECT_NE(unknown.err.find("there is no scenario 'nosuch'; give a file, or one of: "),
            std::string::npos);
  EXPECT_NE(unknown.err.find("single"), std::string::npos) << unknown.err;
}

TEST_F(SimulationTest, AnExistingSearchPathIsKeptBehind) {
  EXPECT_EQ(lines(run("--sim ports", "LD_LIBRARY_PATH=/usr/lib:/nowhere").out), 5U);
  EXPECT_EQ(run("--sim ports", "TVXCIM_RESTARTED=1").exitCode, 3)
      << "a program that was started anew does not start again";
}

TEST_F(SimulationTest, StrictModeFindsNothingInTheProvider) {
  const test::Outcome result = run("--sim --strict ei TVXHBA_FCPort");
  EXPECT_EQ(result.exitCode, 0) << result.err;
  EXPECT_NE(result.err.find("strict: nothing leaked\n"), std::string::npos) << result.err;
}

TEST_F(SimulationTest, AllClassesAreListed) {
  const test::Outcome result = run("classes");
  EXPECT_NE(result.out.find("\n152 classes\n"), std::string::npos);
}

}  // namespace
}  // namespace tvx::host
