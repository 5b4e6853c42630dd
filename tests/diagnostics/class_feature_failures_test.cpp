// The order in which the instances of the tests come into their maps, and what is left when some of
// them can't be made or are refused.
#include "Diagnostics_Fixture.h"
#include "Feature_Maps.h"
#include "Refused_Calls.h"

namespace cimrt::test {
namespace {

using Texts = std::vector<std::string>;

constexpr std::size_t COUNT = 9;
constexpr std::size_t PORTS = 2;

class Class_Feature_Failures : public Diagnostics_Test {
 protected:
  void SetUp() override {
    Diagnostics_Test::SetUp();
    build();
  }
  /// Makes everything anew.
  std::int32_t rebuild() {
    TVX_Diagnostics diagnostics(*agent);
    diagnostics.ClearDiagnosticClassMaps(0);
    log.clear();
    return diagnostics.CreateFCHBADiagnosticClassFeature();
  }
  /// The same with a copy of the present entry in its way.
  void rebuildAgainst(const Feature_Map& row, std::size_t entry) {
    Instance_Map_Base& map = row.of(*agent);
    Ref<Instance> inTheWay(clone(static_cast<const Instance*>(map.at(entry))));
    TVX_Diagnostics diagnostics(*agent);
    diagnostics.ClearDiagnosticClassMaps(0);
    ASSERT_EQ(map.insert(inTheWay.release()), 0u);
    log.clear();
    EXPECT_EQ(diagnostics.CreateFCHBADiagnosticClassFeature(), 0) << row.refusal;
  }
  std::size_t tests() { return agent->m_TVXHBA_FCHBADiagnosticTest_map.size(); }
  static std::string notMade(const char* test) {
    return std::string("Failed to create the maps for ") + test + " ,Check the memory availablity";
  }
  static std::string notInserted(const char* test) {
    return std::string("Failed to insert the Diag Instances into map for DiagTest ") + test;
  }
};

// --- The order

TEST_F(Class_Feature_Failures, InstancesComeInTestByTestAndTheLinksLast) {
  const Texts round = {"TVXHBA_FCHBADiagnosticTest",
                       "TVXHBA_HelpService",
                       "TVXHBA_ServiceAvailableToElement",
                       "TVXHBA_DiagnosticIdentity",
                       "TVXHBA_DiagElementSoftwareIdentity",
                       "TVXHBA_FCHBADiagnosticSettingData",
                       "TVXHBA_DiagElementSettingData",
                       "TVXHBA_FCHBADiagnosticServiceCapabilities",
                       "TVXHBA_DiagElementCapabilities",
                       "TVXHBA_JobSettingData",
                       "TVXHBA_JobElementSettingData",
                       "TVXHBA_DiagnosticsLog",
                       "TVXHBA_UseOfLog",
                       "TVXHBA_AvailableDiagnosticService",
                       "TVXHBA_ServiceAffectsElement",
                       "TVXHBA_AvailableDiagnosticService",
                       "TVXHBA_ServiceAffectsElement"};
  Texts expected = round;
  Texts later = round;
  later.erase(later.begin() + 9);  // the shared settings are there by then
  for (std::size_t i = 1; i < COUNT; i++)
    expected.insert(expected.end(), later.begin(), later.end());
  expected.insert(expected.end(), COUNT, "TVXHBA_DiagServiceConformsToProfile");
  expected.insert(expected.end(), COUNT, "TVXHBA_DiagHostedService");
  expected.insert(expected.end(), COUNT, "TVXHBA_HostedService");
  Texts came;
  const Refused_Calls watch({}, [&](const Instance& instance) {
    came.emplace_back(instance.meta_class->name);
    return false;
  });
  EXPECT_EQ(rebuild(), 0);
  EXPECT_EQ(came, expected);
}

// --- Instances that can't be made

const Meta_Class* unmakeable = nullptr;
Instance* makeAllButOne(const Meta_Class* metaClass) {
  return metaClass == unmakeable ? nullptr : create(metaClass, true);
}

TEST_F(Class_Feature_Failures, ATestWithAnInstanceThatCantBeMadeIsLeftOut) {
  const Meta_Class* const parts[] = {
      &TVXHBA_FCHBADiagnosticTest::static_meta_class,
      &TVXHBA_FCHBADiagnosticSettingData::static_meta_class,
      &TVXHBA_DiagElementSettingData::static_meta_class,
      &TVXHBA_FCHBADiagnosticServiceCapabilities::static_meta_class,
      &TVXHBA_DiagElementCapabilities::static_meta_class,
      &TVXHBA_HelpService::static_meta_class,
      &TVXHBA_ServiceAvailableToElement::static_meta_class,
      &TVXHBA_DiagnosticIdentity::static_meta_class,
      &TVXHBA_DiagElementSoftwareIdentity::static_meta_class,
      &TVXHBA_JobSettingData::static_meta_class,
      &TVXHBA_JobElementSettingData::static_meta_class,
      &TVXHBA_DiagnosticsLog::static_meta_class,
      &TVXHBA_UseOfLog::static_meta_class,
  };
  setDiagnosticFactory(makeAllButOne);
  for (const Meta_Class* part : parts) {
    unmakeable = part;
    EXPECT_EQ(rebuild(), 0) << part->name;
    EXPECT_EQ(featureInstances(*agent), 0u) << "nothing of a round comes in: " << part->name;
    for (const Diagnostic_Row& row : diagnosticTests())
      EXPECT_EQ(log.level(notMade(row.name)), TVX_ERR) << part->name;
  }
}

TEST_F(Class_Feature_Failures, ATestThatCantBeOfferedForLackOfMemoryIsTold) {
  setDiagnosticFactory(makeAllButOne);
  for (const Meta_Class* part : {&TVXHBA_AvailableDiagnosticService::static_meta_class,
                                 &TVXHBA_ServiceAffectsElement::static_meta_class}) {
    unmakeable = part;
    EXPECT_EQ(rebuild(), 0);
    for (const Diagnostic_Row& row : diagnosticTests())
      EXPECT_EQ(log.level(notMade(row.name)), TVX_ERR);
  }
}

// --- Instances that a map refuses

TEST_F(Class_Feature_Failures, ATestThatAMapRefusesIsLeftOutAndTheOthersAreOffered) {
  const std::string gaveUp = notInserted(ECHO_TEST);
  for (std::size_t k = 0; k < std::size(FEATURE_MAPS); k++) {
    const Feature_Map& row = FEATURE_MAPS[k];
    rebuildAgainst(row, k < 12 ? 1 : PORTS);
    EXPECT_EQ(log.only({row.refusal, gaveUp}), (Texts{row.refusal, gaveUp}));
    EXPECT_EQ(log.level(row.refusal), TVX_DBG) << row.refusal;
    EXPECT_EQ(log.level(gaveUp), TVX_ERR);
    for (const Diagnostic_Row& each : diagnosticTests())
      EXPECT_EQ(test(each.name) != nullptr, each.number != Diagnostic_Test::ECHO || k == 0)
          << row.refusal << each.name;
    // The maps before it keep what the round brought, in its own stands what was in the way, and
    // those after it got nothing.
    for (std::size_t i = 1; i < 12; i++)
      EXPECT_EQ(FEATURE_MAPS[i].of(*agent).size(), i <= k ? COUNT : COUNT - 1)
          << row.refusal << " " << i;
    EXPECT_EQ(agent->m_TVXHBA_AvailableDiagnosticService_map.size(),
              PORTS * (COUNT - 1) + (k >= 12 ? 1 : 0));
    EXPECT_EQ(agent->m_TVXHBA_ServiceAffectsElement_map.size(),
              PORTS * (COUNT - 1) + (k == 13 ? 1 : 0));
    EXPECT_EQ(agent->m_TVXHBA_JobSettingData_map.size(), 1u);
    EXPECT_EQ(rebuild(), 0);
  }
}

TEST_F(Class_Feature_Failures, SharedSettingsComeWithTheFirstTestThatGetsSoFar) {
  for (std::size_t k = 0; k < std::size(FEATURE_MAPS); k++) {
    rebuildAgainst(FEATURE_MAPS[k], 0);
    EXPECT_EQ(log.level(notInserted(BEACON_TEST)), TVX_ERR);
    ASSERT_EQ(agent->m_TVXHBA_JobSettingData_map.size(), 1u) << FEATURE_MAPS[k].refusal;
    EXPECT_EQ(textOf(agent->m_TVXHBA_JobSettingData_map[0]->InstanceID),
              "TVX:FCHBA JobSettingData");
    EXPECT_EQ(rebuild(), 0);
  }
}

TEST_F(Class_Feature_Failures, SharedSettingsThatAreRefusedCostTheirTestItsRound) {
  const char* text = "Insert Failed : TVXHBA_JobSettingData_map";
  std::size_t refusals = 1;
  const Refused_Calls refused({}, [&](const Instance& instance) {
    return instance.meta_class == &TVXHBA_JobSettingData::static_meta_class && refusals-- > 0;
  });
  EXPECT_EQ(rebuild(), 0);
  EXPECT_EQ(log.only({text, notInserted(BEACON_TEST)}), (Texts{text, notInserted(BEACON_TEST)}));
  EXPECT_EQ(log.level(text), TVX_DBG);
  EXPECT_EQ(log.level(notInserted(BEACON_TEST)), TVX_ERR);
  EXPECT_EQ(test(BEACON_TEST), nullptr);
  EXPECT_EQ(tests(), COUNT - 1) << "the next test brought them in";
  EXPECT_EQ(agent->m_TVXHBA_DiagElementCapabilities_map.size(), COUNT);
  EXPECT_EQ(agent->m_TVXHBA_JobElementSettingData_map.size(), COUNT - 1);
  refusals = COUNT;
  EXPECT_EQ(rebuild(), 0);
  EXPECT_EQ(log.count(text), COUNT);
  EXPECT_EQ(tests(), 0u);
  EXPECT_EQ(agent->m_TVXHBA_JobSettingData_map.size(), 0u);
}

TEST_F(Class_Feature_Failures, JobSettingsAreInsertedOnlyIntoAnEmptyMap) {
  TVX_Diagnostics diagnostics(*agent);
  Ref<TVXHBA_JobSettingData> other = givenForJobs();
  other->ElementName.set("there before");
  diagnostics.ClearDiagnosticClassMaps(0);
  agent->m_TVXHBA_JobSettingData_map.insert(other.release());
  EXPECT_EQ(diagnostics.CreateFCHBADiagnosticClassFeature(), 0);
  ASSERT_EQ(agent->m_TVXHBA_JobSettingData_map.size(), 1u);
  EXPECT_EQ(textOf(agent->m_TVXHBA_JobSettingData_map[0]->ElementName), "there before");
  EXPECT_EQ(tests(), COUNT);
}

// --- Links

TEST_F(Class_Feature_Failures, LinksThatExistAreToldAndTheRestStands) {
  TVX_Diagnostics diagnostics(*agent);
  EXPECT_EQ(diagnostics.CreateFCHBADiagnosticClassFeature(), 0);
  for (const char* text : {"Insert failed : TVXHBA_ServiceConformsToProfile_map",
                           "Insert failed : TVXHBA_DiagHostedService_map",
                           "Insert failed : TVXHBA_HostedService_map"}) {
    EXPECT_EQ(log.count(text), COUNT) << text;
    EXPECT_EQ(log.level(text), TVX_CRIT) << text;
  }
  EXPECT_EQ(agent->m_TVXHBA_DiagHostedService_map.size(), COUNT);
}

TEST_F(Class_Feature_Failures, MissingProfileIsTold) {
  agent->m_TVXHBA_RegisteredProfile_map.clear();
  EXPECT_EQ(rebuild(), 0);
  EXPECT_EQ(log.level("FCHBA Registration Profile instance missing"), TVX_DBG);
  EXPECT_EQ(agent->m_TVXHBA_DiagServiceConformsToProfile_map.size(), 0u);
  EXPECT_EQ(agent->m_TVXHBA_DiagHostedService_map.size(), COUNT);
  EXPECT_EQ(agent->m_TVXHBA_HostedService_map.size(), COUNT);
}

}  // namespace
}  // namespace cimrt::test
