// The order in which the tests are built, inserted and linked.
#include "diagnostics/ClassFeature.h"

#include "agent/ProductSteps.h"
#include "agent/RegisteredProfiles.h"
#include "diagnostics/TVX_Diagnostics.h"

namespace cimrt {

namespace {

constexpr const char* DIAGNOSTICS_PROFILE = "FCHBA Diagnostics";

// --- Inserting one round

/// Moves one part into its map. False if the map refuses it.
using Insert_Part = bool (*)(Feature_Build& feature, Test_Parts& parts);

struct Insert_Step {
  Insert_Part insert;
  const char* failure;
};

template <auto MAP, auto PART>
bool insertPart(Feature_Build& feature, Test_Parts& parts) {
  if ((feature.agent.*MAP).insert((parts.*PART).get()) == Instance_Map_Base::npos) return false;
  (parts.*PART).release();
  return true;
}

/// The shared settings go in with the first test that comes so far.
bool insertJobSettings(Feature_Build& feature, Test_Parts&) {
  auto& map = feature.agent.m_TVXHBA_JobSettingData_map;
  if (map.size() != 0 || !feature.newJobSettings) return true;
  if (map.insert(feature.newJobSettings.get()) == Instance_Map_Base::npos) return false;
  feature.newJobSettings.release();
  return true;
}

using A = Agent_Maps;
using P = Test_Parts;

// clang-format off
constexpr Insert_Step INSERTS[] = {
    {insertPart<&A::m_TVXHBA_FCHBADiagnosticTest_map, &P::test>,
     "Insert Failed : TVXHBA_FCHBADiagnosticTest_map"},
    {insertPart<&A::m_TVXHBA_HelpService_map, &P::help>,
     "Insert Failed : TVXHBA_HelpService_map"},
    {insertPart<&A::m_TVXHBA_ServiceAvailableToElement_map, &P::helpAvailable>,
     "Insert Failed : TVXHBA_ServiceAvailableToElement_map"},
    {insertPart<&A::m_TVXHBA_DiagnosticIdentity_map, &P::identity>,
     "Insert Failed : TVXHBA_DiagnosticIdentity_map"},
    {insertPart<&A::m_TVXHBA_DiagElementSoftwareIdentity_map, &P::elementIdentity>,
     "Insert Failed : TVXHBA_DiagElementSoftwareIdentity_map"},
    {insertPart<&A::m_TVXHBA_FCHBADiagnosticSettingData_map, &P::settings>,
     "Insert Failed : TVXHBA_FCHBADiagnosticSettingData_map"},
    {insertPart<&A::m_TVXHBA_DiagElementSettingData_map, &P::elementSettings>,
     "Insert Failed : TVXHBA_DiagElementSettingData"},
    {insertPart<&A::m_TVXHBA_FCHBADiagnosticServiceCapabilities_map, &P::capabilities>,
     "Insert Failed : TVXHBA_FCHBADiagnosticServiceCapabilities_map"},
    {insertPart<&A::m_TVXHBA_DiagElementCapabilities_map, &P::elementCapabilities>,
     "Insert Failed : TVXHBA_FCHBAElementCapabilities_map"},
    {insertJobSettings,
     "Insert Failed : TVXHBA_JobSettingData_map"},
    {insertPart<&A::m_TVXHBA_JobElementSettingData_map, &P::jobElementSettings>,
     "Insert Failed : TVXHBA_JobElementSettingData"},
    {insertPart<&A::m_TVXHBA_DiagnosticsLog_map, &P::log>,
     "Insert Failed : DiagnosticsLog_map"},
    {insertPart<&A::m_TVXHBA_UseOfLog_map, &P::useOfLog>,
     "Insert Failed : UseOfLog_map"},
};
// clang-format on

bool insertParts(Feature_Build& feature, Test_Parts& parts) {
  for (const Insert_Step& step : INSERTS) {
    if (step.insert(feature, parts)) continue;
    TVX_LOG(TVX_DBG, "%s", step.failure);
    return false;
  }
  return true;
}

// --- Offering a test to the port controllers

enum class Offer { DONE, NOT_MADE, REFUSED };

template <class T>
Offer offer(Instance_Map<T>& map, Ref<T> association, const char* failure) {
  if (!association) return Offer::NOT_MADE;
  return insertDiagnostic(map, std::move(association), TVX_DBG, "", failure) ? Offer::DONE
                                                                             : Offer::REFUSED;
}

Offer offerTo(ProviderAgent& agent, const Instance* test, const TVXHBA_PortController* controller) {
  auto available = makeDiagnosticAssociation<TVXHBA_AvailableDiagnosticService>(test, controller);
  if (available) available->EstimatedDurationOfService.set(0);
  const Offer first = offer(agent.m_TVXHBA_AvailableDiagnosticService_map, std::move(available),
                            "Insert Failed : TVXHBA_AvailableDiagnosticService_map");
  if (first != Offer::DONE) return first;
  return offer(agent.m_TVXHBA_ServiceAffectsElement_map,
               makeDiagnosticAssociation<TVXHBA_ServiceAffectsElement>(controller, test),
               "Insert Failed : TVXHBA_ServiceAffectsElement_map");
}

Offer offerToAll(ProviderAgent& agent, const Instance* test) {
  auto& controllers = agent.m_TVXHBA_PortController_map;
  for (std::size_t i = 0; i < controllers.size(); i++)
    if (const Offer offered = offerTo(agent, test, controllers[i]); offered != Offer::DONE)
      return offered;
  return Offer::DONE;
}

// --- One round

void logNotMade(const Diagnostic_Row& row) {
  TVX_LOG(TVX_ERR, "Failed to create the maps for %s ,Check the memory availablity", row.name);
}

/// A test that lost its round is taken away; what else the round brought stays.
void giveUpRound(ProviderAgent& agent, const Diagnostic_Row& row, const Instance* inserted) {
  TVX_LOG(TVX_ERR, "Failed to insert the Diag Instances into map for DiagTest %s", row.name);
  if (inserted) agent.m_TVXHBA_FCHBADiagnosticTest_map.delete_instance(inserted);
}

void buildTest(Feature_Build& feature, const Diagnostic_Row& row) {
  Test_Parts parts;
  if (!makeTestParts(feature, row, parts)) return logNotMade(row);
  const TVXHBA_FCHBADiagnosticTest* test = parts.test.get();
  if (!insertParts(feature, parts))
    return giveUpRound(feature.agent, row, parts.test ? nullptr : test);
  switch (offerToAll(feature.agent, test)) {
    case Offer::DONE:
      return;
    case Offer::NOT_MADE:
      return logNotMade(row);
    case Offer::REFUSED:
      return giveUpRound(feature.agent, row, test);
  }
}

// --- Linking

void linkToProfile(ProviderAgent& agent) {
  const TVXHBA_RegisteredProfile* profile = findRegisteredProfile(agent, DIAGNOSTICS_PROFILE);
  if (!profile) {
    TVX_LOG(TVX_DBG, "FCHBA Registration Profile instance missing");
    return;
  }
  auto& tests = agent.m_TVXHBA_FCHBADiagnosticTest_map;
  for (std::size_t i = 0; i < tests.size(); i++)
    associate(agent.m_TVXHBA_DiagServiceConformsToProfile_map, profile, tests[i],
              "Insert failed : TVXHBA_ServiceConformsToProfile_map");
}

void linkToSystem(ProviderAgent& agent, const CIM_ComputerSystem& system) {
  TVX_LOG(TVX_DBG, "Updating the CDM DiagHostService profile ");
  auto& tests = agent.m_TVXHBA_FCHBADiagnosticTest_map;
  for (std::size_t i = 0; i < tests.size(); i++)
    associate(agent.m_TVXHBA_DiagHostedService_map, &system, tests[i],
              "Insert failed : TVXHBA_DiagHostedService_map");
  auto& helpServices = agent.m_TVXHBA_HelpService_map;
  for (std::size_t i = 0; i < helpServices.size(); i++)
    associate(agent.m_TVXHBA_HostedService_map, &system, helpServices[i],
              "Insert failed : TVXHBA_HostedService_map");
}

// --- The port controllers that are there to be tested

/// Asks the port controllers for the version, in turn, until one answers.
bool readVersion(ProviderAgent& agent, std::uint32_t& version) {
  auto& controllers = agent.m_TVXHBA_PortController_map;
  for (std::size_t i = 0; i < controllers.size(); i++)
    if (TVX_Diagnostics::GetDiagnosticVersion(controllers[i]->DeviceID.value.c_str(), &version) ==
        0)
      return true;
  return false;
}

}  // namespace

std::int32_t TVX_Diagnostics::CreateFCHBADiagnosticClassFeature() {
  TVX_LOG(TVX_DBG, "TVX_Diagnostics::CreateFCHBADiagnosticClassFeature");
  const std::size_t count = m_Agent.m_TVXHBA_PortController_map.size();
  if (count == 0) {
    TVX_LOG(TVX_DBG, "Unable to create the FCHBA Diagnostic feature, No managed element exist");
    return DIAGNOSTICS_NO_ELEMENT;
  }
  TVX_LOG(TVX_DBG, "Number of FCHBA ManagedElement : %d", static_cast<int>(count));
  std::uint32_t version = 0;
  if (!readVersion(m_Agent, version) || m_Agent.m_CIM_ComputerSystem_map.size() == 0) {
    TVX_LOG(TVX_DBG, "FCHBA Diagnostics are not supported in any of the managed element");
    return DIAGNOSTICS_NOT_SUPPORTED;
  }
  const CIM_ComputerSystem& system = *m_Agent.m_CIM_ComputerSystem_map[0];
  Feature_Build feature{m_Agent, system, version};
  for (const Diagnostic_Row& row : diagnosticTests()) buildTest(feature, row);
  linkToProfile(m_Agent);
  linkToSystem(m_Agent, system);
  return 0;
}

std::int32_t buildDiagnostics(Host_Build& host) {
  try {
    TVX_Diagnostics diagnostics(host.agent);
    diagnostics.ClearDiagnosticClassMaps(static_cast<int>(Diagnostic_Scope::CLASSES));
    if (diagnostics.CreateFCHBADiagnosticClassFeature() != 0)
      TVX_LOG(TVX_DBG, "FCHBA Diagnositcss either Not Supported/Failed to Create the feature");
  } catch (...) {
    TVX_LOG(TVX_DBG, "Exception in FCHBA Diagnostics feature class creation");
  }
  return 0;
}

void clearDiagnosticClasses(ProviderAgent& agent) {
  TVX_Diagnostics diagnostics(agent);
  diagnostics.ClearDiagnosticClassMaps(static_cast<int>(Diagnostic_Scope::CLASSES));
}

}  // namespace cimrt
