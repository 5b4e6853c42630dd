// The instances of one test, property by property.
#include "common/TVX_Clock.h"
#include "diagnostics/ClassFeature.h"

namespace cimrt {

namespace {

constexpr std::uint16_t IS_DEFAULT = 1;
constexpr std::uint16_t SERVICE_MODE_NONE = 0x8000;
constexpr std::uint16_t SERVICE_MODE_PATTERN = 4;
constexpr std::uint16_t LOG_STORAGE = 2;
constexpr std::uint16_t OTHER_DOCUMENT = 1;
constexpr const char* JOB_SETTINGS_NAME = "TVX:FCHBA JobSettingData";
constexpr const char* DEFAULT_PATTERN = "1a2b3c4d";
constexpr std::uint32_t DEFAULT_PATTERN_SIZE = 8;

template <class To, class From>
void setList(Property<Array<To>>& property, const Short_List<From>& items) {
  for (const From& item : items) property.append(To(item));
}

/// The properties that name a service of the system.
template <class Service>
void nameService(Service& service, const CIM_ComputerSystem& system, const Diagnostic_Row& row) {
  service.SystemCreationClassName = system.CreationClassName;
  service.SystemName = system.Name;
  service.CreationClassName.set(Service::static_meta_class.name);
  service.Name.set(row.name);
}

bool makeTest(Feature_Build& feature, const Diagnostic_Row& row, Test_Parts& parts) {
  parts.test = makeDiagnostic<TVXHBA_FCHBADiagnosticTest>();
  if (!parts.test) return false;
  nameService(*parts.test, feature.system, row);
  parts.test->ElementName.set(row.name);
  parts.test->FCHBATestType.set(row.type);
  setList(parts.test->TestTypes, row.testTypes);
  setList(parts.test->Characteristics, row.characteristics);
  return true;
}

/// What the tests that send a pattern have beyond the others.
void setPatternSettings(TVXHBA_FCHBADiagnosticSettingData& settings, const Diagnostic_Row& row) {
  if (!row.sendsPattern()) return;
  settings.BufferSizes.set({DEFAULT_PATTERN_SIZE});
  for (const char* digit = DEFAULT_PATTERN; *digit; digit++)
    settings.BufferPattern.append(static_cast<std::uint8_t>(*digit));
  if (!row.needsTarget()) return;
  settings.LUN.set(0);
  settings.TargetDevice.set("");
  settings.TargetDeviceFormat.set("2");
  if (row.number == Diagnostic_Test::PING) settings.PingMechanism.set(2);
  if (row.number == Diagnostic_Test::ECHO) settings.EchoMechanism.set(2);
}

bool makeSettings(Feature_Build&, const Diagnostic_Row& row, Test_Parts& parts) {
  parts.settings = makeDiagnostic<TVXHBA_FCHBADiagnosticSettingData>();
  if (!parts.settings) return false;
  TVXHBA_FCHBADiagnosticSettingData& settings = *parts.settings;
  settings.InstanceID.set(row.name);
  settings.ElementName.set(formatText("%s SettingData", row.name).c_str());
  settings.OverridedSettingData.set(0);
  if (row.haltOnError != Halt_On_Error::UNSET)
    settings.HaltOnError.set(row.haltOnError == Halt_On_Error::YES);
  settings.ResultPersistence.set(0xFFFFFFFF);
  settings.LogOptions.set({2, 6});
  settings.LogStorage.set({LOG_STORAGE});
  setList(settings.LoopControl, row.loopControl);
  setList(settings.LoopControlParameter, row.loopControlParameter);
  setPatternSettings(settings, row);
  return true;
}

bool makeElementSettings(Feature_Build&, const Diagnostic_Row&, Test_Parts& parts) {
  parts.elementSettings = makeDiagnosticAssociation<TVXHBA_DiagElementSettingData>(
      parts.test.get(), parts.settings.get());
  if (!parts.elementSettings) return false;
  parts.elementSettings->IsDefault.set(IS_DEFAULT);
  return true;
}

bool makeCapabilities(Feature_Build&, const Diagnostic_Row& row, Test_Parts& parts) {
  parts.capabilities = makeDiagnostic<TVXHBA_FCHBADiagnosticServiceCapabilities>();
  if (!parts.capabilities) return false;
  TVXHBA_FCHBADiagnosticServiceCapabilities& capabilities = *parts.capabilities;
  capabilities.InstanceID.set(row.name);
  capabilities.ElementName.set(formatText("%s Capabilites", row.name).c_str());
  capabilities.SupportedServiceModes.set(
      {row.sendsPattern() ? SERVICE_MODE_PATTERN : SERVICE_MODE_NONE});
  capabilities.SupportedLogStorage.set({LOG_STORAGE});
  capabilities.SupportedLogOptions.set({2, 6});
  setList(capabilities.SupportedLoopControl, row.supportedLoopControl);
  setList(capabilities.SupportedExecutionControls, row.supportedExecutionControls);
  setList(capabilities.OtherSupportedExecutionControlsDescriptions, row.otherExecutionControls);
  return true;
}

bool makeElementCapabilities(Feature_Build&, const Diagnostic_Row&, Test_Parts& parts) {
  parts.elementCapabilities = makeDiagnosticAssociation<TVXHBA_DiagElementCapabilities>(
      parts.test.get(), parts.capabilities.get());
  if (!parts.elementCapabilities) return false;
  TVX_LOG(TVX_DBG, "TVXHBA_DiagElementCapabilities instance (NIC) is created");
  return true;
}

bool makeHelp(Feature_Build& feature, const Diagnostic_Row& row, Test_Parts& parts) {
  parts.help = makeDiagnostic<TVXHBA_HelpService>();
  if (!parts.help) return false;
  TVXHBA_HelpService& help = *parts.help;
  nameService(help, feature.system, row);
  help.ElementName.set(formatText("%s HelpService", row.name).c_str());
  help.DeliveryOptions.set({OTHER_DOCUMENT});
  help.OtherDeliveryOptionDescription.set("String");
  help.DocumentFormat.set({OTHER_DOCUMENT});
  help.OtherDocumentFormatDescription.set("String");
  help.DocumentsAvailable.set({row.name});
  help.DocumentDescriptions.set({row.description});
  return true;
}

bool makeHelpAvailable(Feature_Build&, const Diagnostic_Row&, Test_Parts& parts) {
  parts.helpAvailable = makeDiagnosticAssociation<TVXHBA_ServiceAvailableToElement>(
      parts.help.get(), parts.test.get());
  return static_cast<bool>(parts.helpAvailable);
}

bool makeIdentity(Feature_Build& feature, const Diagnostic_Row& row, Test_Parts& parts) {
  constexpr std::uint16_t DIAGNOSTIC_SOFTWARE = 7;
  parts.identity = makeDiagnostic<TVXHBA_DiagnosticIdentity>();
  if (!parts.identity) return false;
  TVXHBA_DiagnosticIdentity& identity = *parts.identity;
  identity.Name.set(row.name);
  identity.InstanceID.set(row.name);
  identity.ElementName.set(formatText("%s DiagnosticIdentity", row.name).c_str());
  identity.MajorVersion.set(1);
  identity.RevisionNumber.set(1);
  identity.MinorVersion.set(static_cast<std::uint16_t>(feature.version));
  identity.VersionString.set(
      formatText("%d.%d.%d", 1, static_cast<int>(feature.version), 1).c_str());
  identity.Manufacturer.set("Torvex Corporation");
  identity.Classifications.set({DIAGNOSTIC_SOFTWARE});
  identity.ClassificationDescriptions.set({"TVX: FCHBA Diagnostics"});
  identity.IsEntity.set(true);
  identity.Description.set("TVX FCHBA Diagnostics");
  identity.IdentityInfoValue.set({row.name});
  identity.IdentityInfoType.set({"TORVEX:DIAGNOSTICS_NAME"});
  identity.ReleaseDate.set(tvxNowDatetime());
  return true;
}

bool makeElementIdentity(Feature_Build&, const Diagnostic_Row&, Test_Parts& parts) {
  constexpr std::uint16_t CURRENT = 2;
  constexpr std::uint16_t INSTALLED = 6;
  parts.elementIdentity = makeDiagnosticAssociation<TVXHBA_DiagElementSoftwareIdentity>(
      parts.identity.get(), parts.test.get());
  if (!parts.elementIdentity) return false;
  parts.elementIdentity->ElementSoftwareStatus.set({CURRENT, INSTALLED});
  return true;
}

/// One instance serves all tests.
bool makeJobSettings(Feature_Build& feature, const Diagnostic_Row&, Test_Parts&) {
  if (feature.jobSettings) return true;
  feature.newJobSettings = makeDiagnostic<TVXHBA_JobSettingData>();
  feature.jobSettings = feature.newJobSettings.get();
  if (!feature.jobSettings) return false;
  feature.jobSettings->InstanceID.set(JOB_SETTINGS_NAME);
  feature.jobSettings->ElementName.set(JOB_SETTINGS_NAME);
  return true;
}

bool makeJobElementSettings(Feature_Build& feature, const Diagnostic_Row&, Test_Parts& parts) {
  parts.jobElementSettings = makeDiagnosticAssociation<TVXHBA_JobElementSettingData>(
      parts.test.get(), feature.jobSettings);
  if (!parts.jobElementSettings) return false;
  parts.jobElementSettings->IsDefault.set(IS_DEFAULT);
  return true;
}

bool makeLog(Feature_Build&, const Diagnostic_Row& row, Test_Parts& parts) {
  parts.log = makeDiagnostic<TVXHBA_DiagnosticsLog>();
  if (!parts.log) return false;
  TVXHBA_DiagnosticsLog& log = *parts.log;
  log.InstanceID.set(row.name);
  log.ElementName.set(formatText("%s DiagnosticLog", row.name).c_str());
  log.Description.set("TVXHBA_DiagnosticsLog represents the logs for FCHBA CDM tests");
  log.MaxNumberOfRecords.set(200);
  log.CurrentNumberOfRecords.set(0);
  log.OperationalStatus.set({2});
  log.HealthState.set(5);
  return true;
}

bool makeUseOfLog(Feature_Build&, const Diagnostic_Row&, Test_Parts& parts) {
  parts.useOfLog = makeDiagnosticAssociation<TVXHBA_UseOfLog>(parts.log.get(), parts.test.get());
  return static_cast<bool>(parts.useOfLog);
}

using Make_Part = bool (*)(Feature_Build& feature, const Diagnostic_Row& row, Test_Parts& parts);

constexpr Make_Part PARTS[] = {
    makeTest,
    makeSettings,
    makeElementSettings,
    makeCapabilities,
    makeElementCapabilities,
    makeHelp,
    makeHelpAvailable,
    makeIdentity,
    makeElementIdentity,
    makeJobSettings,
    makeJobElementSettings,
    makeLog,
    makeUseOfLog,
};

}  // namespace

bool makeTestParts(Feature_Build& feature, const Diagnostic_Row& row, Test_Parts& parts) {
  for (const Make_Part make : PARTS)
    if (!make(feature, row, parts)) return false;
  return true;
}

}  // namespace cimrt
