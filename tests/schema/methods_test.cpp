// The extrinsic methods of the provider's classes: which, in which order, with which parameters.
#include <gtest/gtest.h>

#include <algorithm>
#include <cstring>
#include <map>
#include <sstream>
#include <string>

#include "runtime/Instance.h"
#include "schema/catalogue.h"
#include "schema/meta_walk.h"

namespace cimrt::test {
namespace {

struct Methods_Of_Class {
  const char* class_name;
  const char* methods;
};

struct Signature {
  const char* method;
  const char* parameters;
};

// clang-format off
constexpr Methods_Of_Class methods_of_classes[] = {
    {"TVXHBA_BootBIOSService", "RequestStateChange StartService StopService ChangeAffectedElementsAssignedSequence EnableBootBIOS DisableBootBIOS GetBootBIOSStatus"},
    {"TVXHBA_Card", "IsCompatible ConnectorPower"},
    {"TVXHBA_ConcreteJob", "KillJob RequestStateChange GetError GetErrors"},
    {"TVXHBA_DiagnosticsLog", "RequestStateChange ClearLog"},
    {"TVXHBA_DumpService", "RequestStateChange StartService StopService ChangeAffectedElementsAssignedSequence GenerateDump GetDumpFileNames DeleteDump"},
    {"TVXHBA_EnabledRecordLogCapabilities", "CreateGoalSettings"},
    {"TVXHBA_FCHBADiagnosticServiceCapabilities", "CreateGoalSettings"},
    {"TVXHBA_FCHBADiagnosticTest", "RequestStateChange StartService StopService ChangeAffectedElementsAssignedSequence RunDiagnostic RunDiagnosticService RunTest ClearResults DiscontinueTest"},
    {"TVXHBA_FCHBADriverParamService", "RequestStateChange StartService StopService ChangeAffectedElementsAssignedSequence SetDriverParameter DisableAllOASLuns"},
    {"TVXHBA_FCHBAWWNService", "RequestStateChange StartService StopService ChangeAffectedElementsAssignedSequence ChangeWWN RestoreWWN ReadWWN GetWWNCapability"},
    {"TVXHBA_FCPort", "RequestStateChange SetPowerState Reset EnableDevice OnlineDevice QuiesceDevice SaveProperties RestoreProperties"},
    {"TVXHBA_FCPortStatistics", "ResetSelectedStats"},
    {"TVXHBA_FCTagService", "RequestStateChange StartService StopService ChangeAffectedElementsAssignedSequence SetConfigTable GetConfigTable SetGlobalFlag GetGlobalFlag"},
    {"TVXHBA_HelpService", "RequestStateChange StartService StopService ChangeAffectedElementsAssignedSequence GetHelp"},
    {"TVXHBA_LogicalDisk", "RequestStateChange SetPowerState Reset EnableDevice OnlineDevice QuiesceDevice SaveProperties RestoreProperties"},
    {"TVXHBA_PCIDevice", "RequestStateChange SetPowerState Reset EnableDevice OnlineDevice QuiesceDevice SaveProperties RestoreProperties BISTExecution"},
    {"TVXHBA_PortController", "RequestStateChange SetPowerState Reset EnableDevice OnlineDevice QuiesceDevice SaveProperties RestoreProperties"},
    {"TVXHBA_RecordLog", "RequestStateChange ClearLog SetLogParams"},
    {"TVXHBA_RegisteredProfile", "CloseConformantInstances OpenConformantInstances PullConformantInstances"},
    {"TVXHBA_RemoteServiceAccessPoint", "RequestStateChange"},
    {"TVXHBA_SCSIArbitraryLogicalUnit", "RequestStateChange SetPowerState Reset EnableDevice OnlineDevice QuiesceDevice SaveProperties RestoreProperties"},
    {"TVXHBA_SCSIProtocolController", "RequestStateChange SetPowerState Reset EnableDevice OnlineDevice QuiesceDevice SaveProperties RestoreProperties"},
    {"TVXHBA_SCSIProtocolEndpoint", "RequestStateChange BroadcastReset"},
    {"TVXHBA_SCSIProtocolInitiatorEndpoint", "RequestStateChange BroadcastReset"},
    {"TVXHBA_SoftwareInstallationService", "RequestStateChange StartService StopService ChangeAffectedElementsAssignedSequence CheckSoftwareIdentity InstallFromSoftwareIdentity InstallFromByteStream InstallFromURI ResetHBA SetPortEnabled GetHBAFeatures SetFECState"},
    {"TVXHBA_SoftwareInstallationServiceCapabilities", "CreateGoalSettings"},
    {"TVXHBA_StorageExtent", "RequestStateChange SetPowerState Reset EnableDevice OnlineDevice QuiesceDevice SaveProperties RestoreProperties"},
    {"TVXHBA_StorageVolume", "RequestStateChange SetPowerState Reset EnableDevice OnlineDevice QuiesceDevice SaveProperties RestoreProperties"},
    {"TVXHBA_TapeDrive", "RequestStateChange SetPowerState Reset EnableDevice OnlineDevice QuiesceDevice SaveProperties RestoreProperties LockMedia"},
    {"TVXHBA_VirtualFCPort", "RequestStateChange SetPowerState Reset EnableDevice OnlineDevice QuiesceDevice SaveProperties RestoreProperties"},
};

constexpr Signature signatures[] = {
    {"BISTExecution", ""},
    {"BroadcastReset", ""},
    {"ChangeAffectedElementsAssignedSequence", "in ref CIM_ManagedElement array ManagedElements, in uint16 array AssignedSequence, out ref CIM_ConcreteJob Job"},
    {"ChangeWWN", "in ref TVXHBA_FCPort Target, in string NewWWPN, in string NewWWNN, in uint16 Type, in out uint16 WWNOperationStatus"},
    {"CheckSoftwareIdentity", "in ref CIM_SoftwareIdentity Source, in ref CIM_ManagedElement Target, in ref CIM_Collection Collection, out uint16 array InstallCharacteristics"},
    {"ClearLog", ""},
    {"ClearResults", "in ref CIM_ManagedSystemElement SystemElement, out string array ResultsNotCleared"},
    {"CloseConformantInstances", "in string EnumerationContext"},
    {"ConnectorPower", "in ref CIM_PhysicalConnector Connector, in boolean PoweredOn"},
    {"CreateGoalSettings", "in ref CIM_SettingData array TemplateGoalSettings, in out ref CIM_SettingData array SupportedGoalSettings"},
    {"DeleteDump", "in ref TVXHBA_FCPort Target"},
    {"DisableAllOASLuns", "in string InitiatorWWPN, in string TargetWWPN"},
    {"DisableBootBIOS", "in ref TVXHBA_FCPort Target"},
    {"DiscontinueTest", "in ref CIM_ManagedSystemElement SystemElement, in ref CIM_DiagnosticResult Result, out boolean TestingStopped"},
    {"EnableBootBIOS", "in ref TVXHBA_FCPort Target"},
    {"EnableDevice", "in boolean Enabled"},
    {"GenerateDump", "in ref TVXHBA_FCPort Target"},
    {"GetBootBIOSStatus", "in ref TVXHBA_FCPort Target, in out uint32 nBootBIOSStatus"},
    {"GetConfigTable", "in ref TVXHBA_FCPort Target, in string URI"},
    {"GetDumpFileNames", "in ref TVXHBA_FCPort Target, in out string array DumpFiles"},
    {"GetError", "in out ref CIM_Error Error"},
    {"GetErrors", "in out ref CIM_Error array Errors"},
    {"GetGlobalFlag", "in ref TVXHBA_FCPort Target, in out uint32 State"},
    {"GetHBAFeatures", "in ref TVXHBA_FCPort Target, in out uint8 array Features"},
    {"GetHelp", "in string RequestedDocument, in out uint16 Format, in uint16 RequestedDelivery, out string DocumentInfo"},
    {"GetWWNCapability", "in ref TVXHBA_FCPort Target, in out uint32 WWNCapability"},
    {"InstallFromByteStream", "out ref CIM_ConcreteJob Job, in uint8 array Image, in ref CIM_ManagedElement Target, in uint16 array InstallOptions, in string array InstallOptionsValues"},
    {"InstallFromSoftwareIdentity", "out ref CIM_ConcreteJob Job, in uint16 array InstallOptions, in string array InstallOptionsValues, in ref CIM_SoftwareIdentity Source, in ref CIM_ManagedElement Target, in ref CIM_Collection Collection"},
    {"InstallFromURI", "out ref CIM_ConcreteJob Job, in string URI, in ref CIM_ManagedElement Target, in uint16 array InstallOptions, in string array InstallOptionsValues"},
    {"IsCompatible", "in ref CIM_PhysicalElement ElementToCheck"},
    {"KillJob", "in boolean DeleteOnKill"},
    {"LockMedia", "in boolean Lock"},
    {"OnlineDevice", "in boolean Online"},
    {"OpenConformantInstances", "in string ResultClass, in string array IncludedPropertyList, in uint32 OperationTimeout, in boolean ContinueOnError, in uint32 MaxObjectCount, out string EnumerationContext, out boolean EndOfSequence, out uint16 array InstanceType, out ref CIM_ManagedElement array InstanceWithPathList"},
    {"PullConformantInstances", "in uint32 MaxObjectCount, in out string EnumerationContext, out boolean EndOfSequence, out uint16 array InstanceType, out ref CIM_ManagedElement array InstanceWithPathList"},
    {"QuiesceDevice", "in boolean Quiesce"},
    {"ReadWWN", "in ref TVXHBA_FCPort Target, in uint16 Type, in out string WWPN, in out string WWNN, in out uint16 WWNOperationStatus"},
    {"RequestStateChange", "in uint16 RequestedState, out ref CIM_ConcreteJob Job, in datetime TimeoutPeriod"},
    {"Reset", ""},
    {"ResetHBA", "in ref TVXHBA_FCPort Target"},
    {"ResetSelectedStats", "in string array SelectedStatistics"},
    {"RestoreProperties", ""},
    {"RestoreWWN", "in ref TVXHBA_FCPort Target, in uint16 Type, in out uint16 WWNOperationStatus"},
    {"RunDiagnostic", "in ref CIM_ManagedElement ManagedElement, in ref CIM_DiagnosticSetting DiagSetting, in ref CIM_JobSettingData JobSetting, out ref CIM_ConcreteJob Job"},
    {"RunDiagnosticService", "in ref CIM_ManagedElement ManagedElement, in ref CIM_DiagnosticSettingData DiagnosticSettings, in ref CIM_JobSettingData JobSettings, out ref CIM_ConcreteJob Job"},
    {"RunTest", "in ref CIM_ManagedSystemElement SystemElement, in ref CIM_DiagnosticSetting Setting, out ref CIM_DiagnosticResult Result"},
    {"SaveProperties", ""},
    {"SetConfigTable", "in ref TVXHBA_FCPort Target, in string URI"},
    {"SetDriverParameter", "in ref TVXHBA_FCPort Target, in boolean bPermanent, in boolean bGlobal, in string strParam, in string strValue"},
    {"SetFECState", "in ref TVXHBA_FCPort Target, in boolean EnableFlag"},
    {"SetGlobalFlag", "in ref TVXHBA_FCPort Target, in uint32 State"},
    {"SetLogParams", "in uint16 LogLevel, in uint16 LogMode, in string TracePath"},
    {"SetPortEnabled", "in ref TVXHBA_FCPort Target, in boolean PortEnabled, in out uint8 ConfigStatus"},
    {"SetPowerState", "in uint16 PowerState, in datetime Time"},
    {"StartService", ""},
    {"StopService", ""},
};
// clang-format on

/// A job takes a state change at once: there is no job for it.
constexpr const char* JOB_STATE_CHANGE = "in uint16 RequestedState, in datetime TimeoutPeriod";

std::string text_of(const Meta_Feature* parameter) {
  std::ostringstream text;
  const bool in = (parameter->flags & FLAG_IN) != 0, out = (parameter->flags & FLAG_OUT) != 0;
  text << (in ? "in " : "") << (out ? "out " : "");
  const bool is_array = is_reference(parameter) ? as_reference(parameter)->subscript != 0
                                                : as_property(parameter)->subscript != 0;
  if (is_reference(parameter)) {
    text << "ref " << as_reference(parameter)->meta_class->name;
  } else {
    text << type_name_table[as_property(parameter)->type];
  }
  text << (is_array ? " array " : " ") << parameter->name;
  return text.str();
}

std::string text_of(const Meta_Method* method) {
  std::string text;
  for (std::size_t i = 0; i + 1 < method->num_meta_features; ++i) {
    text += (i ? ", " : "") + text_of(method->meta_features[i]);
  }
  return text;
}

TEST(Methods, StandInTheClassesInTheirOrder) {
  std::map<std::string, std::string> expected, found;
  for (const Methods_Of_Class& row : methods_of_classes) expected[row.class_name] = row.methods;
  for (const Catalogue_Row& row : catalogue) {
    std::string names;
    for (const Meta_Method* method : methods_of(class_named(row.name))) {
      names += (names.empty() ? "" : " ") + std::string(method->name);
    }
    if (!names.empty()) found[row.name] = names;
  }
  EXPECT_EQ(found, expected);
}

TEST(Methods, HaveTheirSignatures) {
  for (const Catalogue_Row& row : catalogue) {
    for (const Meta_Method* method : methods_of(class_named(row.name))) {
      SCOPED_TRACE(std::string(row.name) + "." + method->name);
      const auto* signature = std::ranges::find_if(
          signatures, [&](const Signature& s) { return std::strcmp(s.method, method->name) == 0; });
      ASSERT_NE(signature, std::end(signatures));
      const bool is_job = std::strcmp(row.name, "TVXHBA_ConcreteJob") == 0 &&
                          std::strcmp(method->name, "RequestStateChange") == 0;
      EXPECT_EQ(text_of(method), is_job ? JOB_STATE_CHANGE : signature->parameters);
    }
  }
}

TEST(Methods, AnswerANumberInTheLastPlaceOfTheRecord) {
  for (const Catalogue_Row& row : catalogue) {
    for (const Meta_Method* method : methods_of(class_named(row.name))) {
      SCOPED_TRACE(std::string(row.name) + "." + method->name);
      const std::string name = method->name;
      const Type expected = name == "CreateGoalSettings" ? UINT16
                            : name == "BISTExecution"    ? UINT8
                                                         : UINT32;
      EXPECT_EQ(method->return_type, expected);
      const Meta_Feature* last = method->meta_features[method->num_meta_features - 1];
      EXPECT_STREQ(last->name, "return_value");
      ASSERT_TRUE(is_property(last));
      EXPECT_EQ(as_property(last)->type, expected);
      EXPECT_EQ(last->flags & (FLAG_IN | FLAG_OUT), FLAG_OUT);
    }
  }
}

TEST(Methods, AJobChangesItsStateWithoutAnotherJob) {
  const Meta_Method* method = find_method(class_named("TVXHBA_ConcreteJob"), "RequestStateChange");
  ASSERT_NE(method, nullptr);
  ASSERT_EQ(method->num_meta_features, 3u);
  EXPECT_EQ(find_property(method, "RequestedState")->offset, 24u);
  EXPECT_EQ(find_property(method, "TimeoutPeriod")->offset, 32u);
  EXPECT_EQ(find_property(method, "return_value")->offset, 48u);
  EXPECT_EQ(method->size, 56u);
  EXPECT_NE(method, find_method(class_named("TVXHBA_FCPort"), "RequestStateChange"));
  EXPECT_EQ(find_feature(method, "Job"), nullptr);
}

TEST(Methods, InstancesInParametersAreMarkedAsEmbedded) {
  const Meta_Method* method =
      find_method(class_named("TVXHBA_FCHBADiagnosticServiceCapabilities"), "CreateGoalSettings");
  EXPECT_NE(find_reference(method, "TemplateGoalSettings")->flags & FLAG_EMBEDDED_INSTANCE, 0u);
  const Meta_Method* by_reference =
      find_method(class_named("TVXHBA_FCTagService"), "SetGlobalFlag");
  EXPECT_EQ(find_reference(by_reference, "Target")->flags & FLAG_EMBEDDED_INSTANCE, 0u);
}

TEST(Methods, AnyObjectIsAReferenceToTheRoot) {
  const Meta_Reference* any = find_reference(class_named("TVXHBA_ConcreteJob"), "JobInParameters");
  ASSERT_NE(any, nullptr);
  EXPECT_EQ(any->meta_class, &Instance::static_meta_class);
  EXPECT_NE(any->flags & FLAG_EMBEDDED_OBJECT, 0u);
}

}  // namespace
}  // namespace cimrt::test
