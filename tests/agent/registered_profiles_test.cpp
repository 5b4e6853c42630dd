// The profiles: their table, their registration, and the computer system's conformance.
#include <map>

#include "Agent_Fixture.h"
#include "Instance_Checks.h"
#include "agent/Map_Insert.h"
#include "agent/RegisteredProfiles.h"

namespace cimrt::test {
namespace {

class Registered_Profiles : public Agent_Test {};

struct Expected_Profile {
  int organization;
  std::string version;
};

const std::map<std::string, Expected_Profile> EXPECTED = {
    {"Profile Registration", {2, "1.0.0"}},
    {"Software Inventory", {2, "1.0.0"}},
    {"Physical Package", {11, "1.3.0"}},
    {"Host Discovered Resources", {11, "1.2.0"}},
    {"FC HBA", {11, "1.2.0"}},
    {"Storage HBA", {11, "1.4.0"}},
    {"FC Initiator Ports", {11, "1.3.0"}},
    {"Software", {11, "1.2.0"}},
    {"Access Points", {11, "1.3.0"}},
    {"PCI Device", {2, "1.0.0"}},
    {"FCHBA Diagnostics", {2, "1.0.0"}},
    {"Physical Asset", {2, "1.0.2"}},
    {"Record Log", {2, "1.0.1"}},
    {"Software Update", {2, "1.0.0"}},
};

std::vector<std::string> namesOf(std::span<const Profile_Row> rows) {
  std::vector<std::string> names;
  for (const Profile_Row& row : rows) names.emplace_back(row.name);
  return names;
}

TEST_F(Registered_Profiles, BaseProfilesInTheirOrder) {
  EXPECT_EQ(namesOf(baseProfiles()),
            (std::vector<std::string>{
                "Profile Registration", "Software Inventory", "Physical Package",
                "Host Discovered Resources", "FC HBA", "Storage HBA", "FC Initiator Ports",
                "Software", "Access Points", "PCI Device", "FCHBA Diagnostics", "Physical Asset"}));
}

TEST_F(Registered_Profiles, EnumeratedProfilesInTheirOrder) {
  EXPECT_EQ(namesOf(enumeratedProfiles()),
            (std::vector<std::string>{"Profile Registration", "Software Inventory",
                                      "Physical Package", "Host Discovered Resources", "FC HBA",
                                      "Storage HBA", "FC Initiator Ports", "Software Update",
                                      "Record Log", "Software", "Access Points", "PCI Device",
                                      "FCHBA Diagnostics", "Physical Asset"}));
}

TEST_F(Registered_Profiles, ReferencedProfilesLeaveOutTheFirstAndTheLast) {
  EXPECT_EQ(namesOf(referencedProfiles()),
            (std::vector<std::string>{
                "Software Inventory", "Physical Package", "Host Discovered Resources", "FC HBA",
                "Storage HBA", "FC Initiator Ports", "Software Update", "Record Log", "Software",
                "Access Points", "PCI Device", "FCHBA Diagnostics"}));
}

TEST_F(Registered_Profiles, EveryRowHasItsOrganizationAndVersion) {
  ASSERT_EQ(enumeratedProfiles().size(), EXPECTED.size());
  for (const Profile_Row& row : enumeratedProfiles()) {
    SCOPED_TRACE(row.name);
    ASSERT_TRUE(EXPECTED.contains(row.name));
    EXPECT_EQ(row.organization, EXPECTED.at(row.name).organization);
    EXPECT_EQ(row.version, EXPECTED.at(row.name).version);
  }
}

TEST_F(Registered_Profiles, InstanceOfAProfile) {
  const auto profile = makeRegisteredProfile({"FC HBA", 11, "1.2.0"});
  EXPECT_TRUE(profile->__name_space == "root/pg_interop");
  EXPECT_EQ(textOf(profile->InstanceID), "TVX:FC HBA");
  EXPECT_EQ(textOf(profile->Description), "Torvex FC HBA");
  EXPECT_EQ(textOf(profile->ElementName), "Torvex Registered FC HBA");
  EXPECT_EQ(numberOf(profile->RegisteredOrganization), 11);
  EXPECT_EQ(textOf(profile->RegisteredName), "FC HBA");
  EXPECT_EQ(textOf(profile->RegisteredVersion), "1.2.0");
  EXPECT_EQ(numbersOf(profile->AdvertiseTypes), (std::vector<std::uint16_t>{3}));
  EXPECT_EQ(textsOf(profile->AdvertiseTypeDescriptions), (std::vector<std::string>{"SLP"}));
}

TEST_F(Registered_Profiles, SecondRegistrationKeepsTheFirstInstance) {
  ProviderAgent& agent = startAgent();
  log.clear();
  const auto* first = createRegisteredProfile(agent, "Record Log", 2, "1.0.1");
  ASSERT_NE(first, nullptr);
  EXPECT_EQ(createRegisteredProfile(agent, "Record Log", 11, "9.9.9"), first);
  EXPECT_EQ(agent.m_TVXHBA_RegisteredProfile_map.size(), 1u);
  EXPECT_EQ(numberOf(first->RegisteredOrganization), 2);
  EXPECT_EQ(textOf(first->RegisteredVersion), "1.0.1");
  const std::vector<std::string> texts = {
      "Generating TVXHBA_RegisteredProfile (Record Log)",
      "Created TVXHBA_RegisteredProfile in the map (Record Log)",
      "Got TVXHBA_RegisteredProfile in the map (Record Log)"};
  EXPECT_EQ(log.only(texts), (std::vector<std::string>{texts[0], texts[1], texts[0], texts[2]}));
  EXPECT_EQ(findRegisteredProfile(agent, "Record Log"), first);
  EXPECT_EQ(findRegisteredProfile(agent, "Software"), nullptr);
}

TEST_F(Registered_Profiles, OwnSystemConforms) {
  ProviderAgent& agent = startAgent();
  auto system = makeInstance<CIM_ComputerSystem>();
  system->Name.set("host");
  system->CreationClassName.set("CIM_ComputerSystem");
  const CIM_ComputerSystem* entry =
      insertInto(agent.m_CIM_ComputerSystem_map, std::move(system), "x");
  agent.m_bOwnComputerSystem = true;
  const auto* profile = createRegisteredProfile(agent, "Software", 11, "1.2.0");
  createComputerSystemConformsToProfile(agent, profile);
  EXPECT_EQ(log.count("inside createComputerSystemConformsToProfile"), 1u);
  EXPECT_EQ(log.count("Computer System,TVX:Software"), 1u);
  ASSERT_EQ(agent.m_TVXHBA_ComputerSystemConformsToProfile_map.size(), 1u);
  EXPECT_TRUE(tiesClones(agent.m_TVXHBA_ComputerSystemConformsToProfile_map[0], profile, entry));
  createComputerSystemConformsToProfile(agent, nullptr);
  EXPECT_EQ(agent.m_TVXHBA_ComputerSystemConformsToProfile_map.size(), 1u);
}

TEST_F(Registered_Profiles, PlatformsSystemIsLeftAlone) {
  ProviderAgent& agent = startAgent();
  createComputerSystemConformsToProfile(agent,
                                        createRegisteredProfile(agent, "Software", 11, "1.2.0"));
  EXPECT_EQ(log.count("This is IBM/VMWare comp Sys - do nothing"), 1u);
  EXPECT_EQ(agent.m_TVXHBA_ComputerSystemConformsToProfile_map.size(), 0u);
}

TEST_F(Registered_Profiles, RefreshRegistersFourteenAndTheSystemConformsToThirteen) {
  ProviderAgent& agent = startAgent();
  refresh(agent);
  auto& map = agent.m_TVXHBA_RegisteredProfile_map;
  ASSERT_EQ(map.size(), 14u);
  for (std::size_t i = 0; i < 12; i++)
    EXPECT_EQ(textOf(map[i]->RegisteredName), baseProfiles()[i].name);
  EXPECT_EQ(textOf(map[12]->RegisteredName), "Software Update");
  EXPECT_EQ(textOf(map[13]->RegisteredName), "Record Log");
  EXPECT_EQ(agent.m_TVXHBA_ComputerSystemConformsToProfile_map.size(), 13u);
  EXPECT_EQ(log.count("Computer System,TVX:Record Log"), 1u);
  EXPECT_EQ(log.count("Computer System,TVX:Software Update"), 0u);
}

TEST_F(Registered_Profiles, HostWithoutAdaptersStillRegistersTheBaseProfiles) {
  useScenario(R"({"cards": []})");
  ProviderAgent& agent = startAgent();
  refresh(agent);
  EXPECT_EQ(agent.m_TVXHBA_ComputerSystemConformsToProfile_map.size() >= 12, true);
  EXPECT_NE(findRegisteredProfile(agent, "Physical Asset"), nullptr);
  EXPECT_EQ(findRegisteredProfile(agent, "Software Update"), nullptr);
}

}  // namespace
}  // namespace cimrt::test
