// Results of diagnostic tests, looked at and cleared by further commands of one session.
#include <gtest/gtest.h>

#include <algorithm>
#include <sstream>
#include <vector>

#include "cli/Options.h"
#include "cli/Session.h"
#include "schema/ClassData.h"

namespace tvx::host {
namespace {

Options parsed(std::vector<const char*> words) {
  words.insert(words.begin(), {"tvxcim", "--strict", "--lib", PROVIDER_LIBRARY});
  int exitCode = 0;
  std::optional<Options> options =
      parseOptions(static_cast<int>(words.size()), words.data(), exitCode);
  EXPECT_TRUE(options.has_value()) << words.back();
  return options.value_or(Options());
}

class DiagResultsTest : public ::testing::Test {
 protected:
  std::string printed(const std::vector<const char*>& words) {
    m_Out.str("");
    EXPECT_EQ(parsed(words).run(m_Session), ExitCode::Ok) << words.back();
    return m_Out.str();
  }

  const ClassCatalogue m_Classes{allClasses, allClassCount};
  const Options m_Options = parsed({"diag", "results"});
  std::ostringstream m_Out;
  std::ostringstream m_Err;
  Session m_Session{m_Options, m_Classes, m_Out, m_Err};
};

TEST_F(DiagResultsTest, StandUntilTheyAreCleared) {
  constexpr const char* port = "10000254560C4110";
  EXPECT_EQ(printed({"diag", "run", "status", port}),
            "passed: TVX:FCHBA Status Test Resulted with Success\n");
  EXPECT_EQ(printed({"diag", "run", "status", port}),
            "passed: TVX:FCHBA Status Test Resulted with Success\n");
  const std::string table = printed({"diag", "results"});
  EXPECT_EQ(table.find("Job "), 0U) << table;
  EXPECT_EQ(std::count(table.begin(), table.end(), '\n'), 3) << table;
  EXPECT_NE(table.find("  passed   "), std::string::npos) << table;
  EXPECT_NE(table.find("TVX:FCHBA Status Test Resulted with Success\n"), std::string::npos);
  EXPECT_EQ(printed({"diag", "clear", "self"}), "1 log cleared\n");
  EXPECT_EQ(printed({"diag", "results"}), table);
  EXPECT_EQ(printed({"diag", "clear", "status"}), "1 log cleared\n");
  EXPECT_EQ(printed({"diag", "results"}),
            "no results; they last as long as the provider stays loaded\n");
  EXPECT_EQ(m_Session.finish(), ExitCode::Ok) << m_Err.str();
}

}  // namespace
}  // namespace tvx::host
