// Libraries that offer less than all, and scenarios that cannot be used.
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <functional>
#include <nlohmann/json.hpp>

#include "sim/Libraries.h"

namespace tvx::sim_test {
namespace {

std::string capture_errors(const std::function<void()>& body) {
  testing::internal::CaptureStderr();
  body();
  return testing::internal::GetCapturedStderr();
}

class Variants : public ::testing::Test {
 protected:
  ~Variants() override {
    unsetenv("TVX_SIM_SCENARIO");
    tvxsim_load_text("{}");
  }
};

TEST_F(Variants, AnOmittedSymbolIsNotFoundAndComesBackWithTheNextScenario) {
  ASSERT_EQ(tvxsim_load_text(R"({"omit_symbols": ["LRM_ChangeWWN", "RM_MiliVersion"]})"), 0);
  {
    const Library rm(TVXSIM_LRMAPI);
    EXPECT_FALSE(rm.has("LRM_ChangeWWN"));
    EXPECT_FALSE(rm.has("RM_MiliVersion"));
    EXPECT_TRUE(rm.has("LRM_RestoreWWN"));
    EXPECT_EQ(SIM_CALL(rm, LRM_InitLib), 0);
  }
  ASSERT_EQ(tvxsim_load_text("{}"), 0);
  const Library rm(TVXSIM_LRMAPI);
  EXPECT_TRUE(rm.has("LRM_ChangeWWN"));
  EXPECT_TRUE(rm.has("RM_MiliVersion"));
}

TEST_F(Variants, SymbolsOfTheSniaLibraryCanBeOmittedToo) {
  ASSERT_EQ(tvxsim_load_text(R"({"omit_symbols": ["HBA_OpenAdapter"]})"), 0);
  const Library hba(TVXSIM_HBAAPI);
  EXPECT_FALSE(hba.has("HBA_OpenAdapter"));
  EXPECT_TRUE(hba.has("HBA_CloseAdapter"));
}

TEST_F(Variants, TheNewerLibraryHasTheLongerNamesAndTheOnlyShortOnes) {
  const Library rm(TVXSIM_LRMAPI);
  for (const char* name : {"LRM_InitLib", "LRM_GetHBAAttributes", "RM_GetAttributeValue",
                           "RM_IsLocalHBA", "TvxGetBoardNumber"}) {
    EXPECT_TRUE(rm.has(name)) << name;
  }
  EXPECT_FALSE(rm.has("RM_InitLib"));
  EXPECT_FALSE(rm.has("RM_GetHBAAttributes"));
}

TEST_F(Variants, TheOlderLibraryHasTheShorterNamesOnly) {
  tvxsim_load(TVXSIM_SCENARIOS "/default.json");
  const Library rm(TVXSIM_RMAPI);
  EXPECT_FALSE(rm.has("LRM_InitLib"));
  EXPECT_TRUE(rm.has("RM_ChangeWWN"));
  EXPECT_TRUE(rm.has("RM_GetAttributeValue"));
  std::uint32_t type = 0;
  EXPECT_EQ(rm.entry<RM_STATUS()>("RM_InitLib")(), 0);
  EXPECT_EQ(rm.entry<decltype(LRM_GetDriverType)>("RM_GetDriverType")(first_port, &type), 0);
  EXPECT_EQ(type, 5u);
  EXPECT_EQ(rm.entry<int(HBA_WWN)>("TvxGetBoardNumber")(first_port), 0);
  EXPECT_EQ(rm.entry<int(HBA_WWN)>("TvxGetBoardNumber")(wwn(3)), -1);
}

TEST_F(Variants, EachSetOfLibrariesOffersWhatItsNameSays) {
  const std::filesystem::path sets = TVXSIM_SETS;
  const auto offers = [&sets](const char* set, const char* file) {
    return std::filesystem::exists(sets / set / file);
  };
  EXPECT_TRUE(offers("old-name", "librmapi.so"));
  EXPECT_TRUE(offers("old-name", "HBAAPI.so.2"));
  EXPECT_FALSE(offers("old-name", "liblrmapi.so"));
  EXPECT_TRUE(offers("no-snia", "liblrmapi.so"));
  EXPECT_FALSE(offers("no-snia", "HBAAPI.so.2"));
  EXPECT_TRUE(offers("plain-snia", "HBAAPI.so"));
  EXPECT_TRUE(offers("plain-snia", "liblrmapi.so"));
  EXPECT_TRUE(offers("snia-only", "HBAAPI.so.2"));
  EXPECT_TRUE(std::filesystem::is_empty(sets / "none"));
  const Library linked((sets / "plain-snia" / "HBAAPI.so").c_str());
  EXPECT_TRUE(linked.has("HBA_LoadLibrary"));
}

TEST_F(Variants, TheEnvironmentNamesTheScenario) {
  setenv("TVX_SIM_SCENARIO", TVXSIM_SCENARIOS "/single.json", 1);
  ASSERT_EQ(tvxsim_load(nullptr), 0) << tvxsim_last_error();
  const Library hba(TVXSIM_HBAAPI);
  EXPECT_EQ(SIM_CALL(hba, HBA_LoadLibrary), 0u);
  EXPECT_EQ(SIM_CALL(hba, HBA_GetNumberOfAdapters), 1u);
  setenv("TVX_SIM_SCENARIO", TVXSIM_SCENARIOS "/none.json", 1);
  EXPECT_EQ(SIM_CALL(hba, HBA_GetNumberOfAdapters), 1u);
  EXPECT_EQ(SIM_CALL(hba, HBA_LoadLibrary), 0u);
  EXPECT_EQ(SIM_CALL(hba, HBA_GetNumberOfAdapters), 0u);
  unsetenv("TVX_SIM_SCENARIO");
  EXPECT_EQ(SIM_CALL(hba, HBA_LoadLibrary), 0u);
  EXPECT_EQ(SIM_CALL(hba, HBA_GetNumberOfAdapters), 5u);
}

TEST_F(Variants, AChangedFileIsReadAnewWhenTheLibraryIsInitialised) {
  const auto path = std::filesystem::temp_directory_path() /
                    ("tvxsim_changed_" + std::to_string(getpid()) + ".json");
  std::ofstream(path) << R"({"cards": [{"ports": [{}, {}]}]})";
  setenv("TVX_SIM_SCENARIO", path.c_str(), 1);
  ASSERT_EQ(tvxsim_load(nullptr), 0);
  const Library rm(TVXSIM_LRMAPI);
  EXPECT_EQ(SIM_CALL(rm, RM_GetNumberOfLocalAdapters), 2u);
  std::ofstream(path) << R"({"cards": [{"ports": [{}, {}, {}]}]})";
  EXPECT_EQ(SIM_CALL(rm, LRM_InitLib), 0);
  EXPECT_EQ(SIM_CALL(rm, RM_GetNumberOfLocalAdapters), 3u);
  std::filesystem::remove(path);
}

TEST_F(Variants, AnUnusableScenarioGivesNoAdaptersAndOneLine) {
  const Library hba(TVXSIM_HBAAPI);
  const std::string line = capture_errors([] { tvxsim_load("/no/such/scenario.json"); });
  EXPECT_EQ(line, "tvxsim: /no/such/scenario.json: /: cannot be read\n");
  EXPECT_EQ(SIM_CALL(hba, HBA_GetNumberOfAdapters), 0u);
}

struct Bad_Scenario {
  const char* text;
  const char* message;
};

class Bad_Scenarios : public ::testing::TestWithParam<Bad_Scenario> {};

TEST_P(Bad_Scenarios, AreRefusedWithThePlaceOfTheMistake) {
  const std::string line = capture_errors([] { EXPECT_EQ(tvxsim_load_text(GetParam().text), -1); });
  EXPECT_EQ(line, std::string("tvxsim: text: ") + GetParam().message + "\n");
  EXPECT_EQ(tvxsim_last_error(), std::string("text: ") + GetParam().message);
  const Library rm(TVXSIM_LRMAPI);
  EXPECT_EQ(SIM_CALL(rm, RM_GetNumberOfLocalAdapters), 0u);
  tvxsim_load_text("{}");
}

INSTANTIATE_TEST_SUITE_P(
    All, Bad_Scenarios,
    ::testing::Values(
        Bad_Scenario{"[]", "/: must be an object"},
        Bad_Scenario{R"({"card": []})", "/card: is not a name that is known here"},
        Bad_Scenario{R"({"cards": 3})", "/cards: must be an array of objects"},
        Bad_Scenario{R"({"cards": [3]})", "/cards/0: must be an object"},
        Bad_Scenario{R"({"cards": [{}]})", "/cards/0/ports: must hold at least one port"},
        Bad_Scenario{R"({"cards": [{"ports": [{"wwpn": "12"}]}]})",
                     "/cards/0/ports/0/wwpn: must be a world wide name: 16 hexadecimal digits or "
                     "eight pairs"},
        Bad_Scenario{R"({"cards": [{"ports": [{"fc_id": -1}]}]})",
                     "/cards/0/ports/0/fc_id: must be a number from 0 to 4294967295"},
        Bad_Scenario{R"({"cards": [{"ports": [{}, {"spede": 1}]}]})",
                     "/cards/0/ports/1/spede: is not a name that is known here"},
        Bad_Scenario{R"({"cards": [{"model": 1, "ports": [{}]}]})",
                     "/cards/0/model: must be a text"},
        Bad_Scenario{R"({"cards": [{"attributes": {"nothing": 1}, "ports": [{}]}]})",
                     "/cards/0/attributes/nothing: is not an attribute that is known here"},
        Bad_Scenario{R"({"cards": [{"ports": [{"targets": [{}]}]}]})",
                     "/cards/0/ports/0/targets/0/wwpn: is missing"},
        Bad_Scenario{R"({"cards": [{"ports": [{"boot_code_enabled": 1}]}]})",
                     "/cards/0/ports/0/boot_code_enabled: must be true or false"},
        Bad_Scenario{R"({"faults": [{"call": "X", "omit_attributes": "unheard"}]})",
                     "/faults/0/omit_attributes: does not know the attribute \"unheard\""},
        Bad_Scenario{R"({"faults": [{"call": "X", "nth": 1, "first": 2}]})",
                     "/faults/0/nth: excludes \"first\" and \"from\""},
        Bad_Scenario{R"({"cards": [{"ports": [{"wwpn": "1000000000000001"},
                        {"wwpn": "1000000000000001"}]}]})",
                     "/cards/0/ports/1/wwpn: is the name of another port too"}));

TEST_F(Variants, TextThatIsNotJsonIsRefused) {
  const std::string line = capture_errors([] { EXPECT_EQ(tvxsim_load_text("{"), -1); });
  EXPECT_NE(line.find("/: is not JSON: "), std::string::npos) << line;
}

// Every member that the schema names is one that the reader asks for.
void expect_known(const nlohmann::json& properties, const std::string& pointer,
                  const std::function<nlohmann::json(const nlohmann::json&)>& scenario_with) {
  ASSERT_FALSE(properties.empty());
  for (const auto& member : properties.items()) {
    const nlohmann::json object = {{member.key(), {{"odd", 1}}}};
    tvxsim_load_text(scenario_with(object).dump().c_str());
    EXPECT_EQ(std::string(tvxsim_last_error())
                  .find(pointer + "/" + member.key() + ": is not a name that is known"),
              std::string::npos)
        << tvxsim_last_error();
  }
}

TEST_F(Variants, TheSchemaNamesOnlyMembersThatAreKnown) {
  using nlohmann::json;
  std::ifstream file(TVXSIM_SCENARIOS "/../scenario.schema.json");
  const json schema = json::parse(file);
  capture_errors([&schema] {
    const json port = json::object();
    expect_known(schema["$defs"]["port"]["properties"], "/cards/0/ports/0", [](const json& object) {
      return json{{"cards", {{{"ports", {object}}}}}};
    });
    expect_known(schema["properties"]["cards"]["items"]["properties"], "/cards/0",
                 [&port](json object) {
                   if (!object.contains("ports")) object["ports"] = {port};
                   return json{{"cards", {object}}};
                 });
    expect_known(schema["properties"]["faults"]["items"]["properties"], "/faults/0",
                 [](json object) {
                   if (!object.contains("call")) object["call"] = "LRM_InitLib";
                   return json{{"faults", {object}}};
                 });
    expect_known(schema["properties"], "", [](const json& object) { return object; });
  });
}

class Shipped_Scenarios : public ::testing::TestWithParam<std::filesystem::path> {};

TEST_P(Shipped_Scenarios, CanBeUsed) {
  EXPECT_EQ(tvxsim_load(GetParam().c_str()), 0) << tvxsim_last_error();
  tvxsim_load_text("{}");
}

std::vector<std::filesystem::path> shipped_scenarios() {
  const std::filesystem::directory_iterator folder(TVXSIM_SCENARIOS);
  return {begin(folder), end(folder)};
}

INSTANTIATE_TEST_SUITE_P(All, Shipped_Scenarios, ::testing::ValuesIn(shipped_scenarios()),
                         [](const auto& shipped) {
                           std::string name = shipped.param.stem();
                           std::replace(name.begin(), name.end(), '-', '_');
                           return name;
                         });

}  // namespace
}  // namespace tvx::sim_test
