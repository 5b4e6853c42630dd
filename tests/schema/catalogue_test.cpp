// The classes, against the catalogue of what clients rely on.
#include "schema/catalogue.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cctype>
#include <cstring>
#include <map>
#include <string>

#include "schema/meta_walk.h"

namespace cimrt::test {
namespace {

TEST(Catalogue, HasOneHundredAndFiftyTwoClassesOfWhichOneHundredAreAssociations) {
  EXPECT_EQ(std::size(catalogue), 152u);
  EXPECT_EQ(num_provider_classes, 152u);
  EXPECT_EQ(std::ranges::count_if(catalogue, &Catalogue_Row::is_association), 100);
  EXPECT_EQ(std::ranges::count(catalogue, 'G', &Catalogue_Row::kind), 27);
}

TEST(Catalogue, EveryRowDescribesItsClass) {
  for (const Catalogue_Row& row : catalogue) {
    SCOPED_TRACE(row.name);
    const Meta_Class* meta_class = class_named(row.name);
    ASSERT_NE(meta_class, nullptr);
    ASSERT_NE(meta_class->super_meta_class, nullptr);
    EXPECT_STREQ(meta_class->super_meta_class->name, row.super_name);
    EXPECT_EQ(meta_class->num_keys, row.keys);
    EXPECT_EQ(count(meta_class, FLAG_KEY), row.keys);
    EXPECT_EQ(count(meta_class, FLAG_PROPERTY), row.properties);
    EXPECT_EQ(count(meta_class, FLAG_REFERENCE), row.references);
    EXPECT_EQ(count(meta_class, FLAG_METHOD), row.methods);
    EXPECT_EQ((meta_class->flags & FLAG_ASSOCIATION) != 0, row.kind != 'I');
    EXPECT_EQ((meta_class->flags & FLAG_AGGREGATION) != 0, row.kind == 'G');
    EXPECT_EQ((meta_class->flags & FLAG_CLASS) != 0, row.kind == 'I');
    EXPECT_EQ(meta_class->flags & FLAG_ABSTRACT, 0u);
  }
}

TEST(Catalogue, TheProviderClassesComeFirstInTheRepositoryInTheOrderOfTheCatalogue) {
  for (std::size_t i = 0; i < num_provider_classes; ++i) {
    EXPECT_STREQ(meta_repository.meta_classes[i]->name, catalogue[i].name);
  }
}

TEST(Catalogue, ThirtyClassesHaveMethods) {
  EXPECT_EQ(std::ranges::count_if(catalogue, [](const auto& row) { return row.methods > 0; }), 30);
  for (const Catalogue_Row& row : catalogue) {
    if (row.is_association()) {
      EXPECT_EQ(row.methods, 0u) << row.name;
    }
  }
}

TEST(Repository, HoldsAllFamilies) {
  std::map<std::string, int> families;
  for (const Meta_Class* meta_class : all_classes()) {
    const std::string name = meta_class->name;
    ++families[name.substr(0, name.find('_'))];
    EXPECT_EQ(meta_class->meta_repository, &meta_repository) << name;
    EXPECT_EQ(meta_class->refs.load(), 0u) << name;
  }
  const std::map<std::string, int> expected = {
      {"TVXHBA", 152}, {"CIM", 116}, {"IBMSD", 2}, {"PG", 1}};
  EXPECT_EQ(families, expected);
}

TEST(Repository, FindsEveryClassInAnyCaseOfLetters) {
  for (const Meta_Class* meta_class : all_classes()) {
    std::string upper = meta_class->name, lower = meta_class->name;
    std::ranges::transform(upper, upper.begin(), [](unsigned char c) { return std::toupper(c); });
    std::ranges::transform(lower, lower.begin(), [](unsigned char c) { return std::tolower(c); });
    EXPECT_EQ(class_named(meta_class->name), meta_class);
    EXPECT_EQ(class_named(upper.c_str()), meta_class);
    EXPECT_EQ(class_named(lower.c_str()), meta_class);
  }
  EXPECT_EQ(class_named("TVXHBA_Nothing"), nullptr);
}

TEST(Repository, NoQualifierReachesRunTime) {
  for (const Meta_Class* meta_class : all_classes()) {
    EXPECT_EQ(meta_class->num_meta_qualifiers, 0u);
    EXPECT_EQ(meta_class->meta_qualifiers, nullptr);
    for (const Meta_Feature* feature : features_of(meta_class)) {
      EXPECT_EQ(feature->num_meta_qualifiers, 0u) << meta_class->name << "." << feature->name;
    }
  }
}

TEST(Repository, EveryFeatureIsOfOneKindAndPropertiesAreReadable) {
  for (const Meta_Class* meta_class : all_classes()) {
    for (const Meta_Feature* feature : features_of(meta_class)) {
      SCOPED_TRACE(std::string(meta_class->name) + "." + feature->name);
      EXPECT_EQ(is_property(feature) + is_reference(feature) + is_method(feature), 1);
      if (is_property(feature)) {
        EXPECT_NE(feature->flags & FLAG_READ, 0u);
      }
      if (is_reference(feature)) {
        EXPECT_EQ(as_reference(feature)->subscript, 0);
      }
    }
  }
}

TEST(Repository, ServerSideClassesDescendFromTheSchemasClasses) {
  EXPECT_EQ(is_subclass(&meta_repository, "CIM_ComputerSystem", "IBMSD_ComputerSystem"), 0);
  EXPECT_EQ(is_subclass(&meta_repository, "CIM_Chassis", "IBMSD_Chassis"), 0);
  EXPECT_EQ(is_subclass(&meta_repository, "CIM_RegisteredProfile", "PG_RegisteredProfile"), 0);
  EXPECT_EQ(class_named("CIM_Error")->flags & (FLAG_INDICATION | FLAG_CLASS), FLAG_INDICATION);
}

/// Classes with a flag, and properties, references and methods that a class itself declares with
/// it.
struct Flag_Count {
  std::uint32_t flag;
  std::size_t classes;
  std::size_t features;
};

TEST(Flags, StandOnAsManyClassesAndFeaturesAsTheSchemaSays) {
  const Flag_Count counts[] = {
      {FLAG_ABSTRACT, 24, 0},     {FLAG_ASSOCIATION, 140, 0},   {FLAG_AGGREGATION, 36, 0},
      {FLAG_COMPOSITION, 22, 0},  {FLAG_INDICATION, 1, 0},      {FLAG_EXCEPTION, 1, 0},
      {FLAG_COUNTER, 0, 51},      {FLAG_GAUGE, 0, 2},           {FLAG_WRITE, 0, 52},
      {FLAG_EXPERIMENTAL, 0, 46}, {FLAG_REQUIRED, 0, 20},       {FLAG_AGGREGATE, 0, 8},
      {FLAG_WEAK, 0, 3},          {FLAG_EMBEDDED_OBJECT, 0, 2}, {FLAG_EMBEDDED_INSTANCE, 0, 1},
  };
  for (const Flag_Count& expected : counts) {
    std::size_t classes = 0, features = 0;
    for (const Meta_Class* meta_class : all_classes()) {
      classes += (meta_class->flags & expected.flag) != 0;
      for (std::size_t i = 0; i < meta_class->num_meta_features; ++i) {
        features += meta_class->locals[i] && (meta_class->meta_features[i]->flags & expected.flag);
      }
    }
    EXPECT_EQ(classes, expected.classes) << std::hex << expected.flag;
    EXPECT_EQ(features, expected.features) << std::hex << expected.flag;
  }
}

TEST(Flags, StandWhereClientsLookForThem) {
  const auto flags = [](const char* class_name, const char* feature) {
    return find_feature(class_named(class_name), feature)->flags;
  };
  EXPECT_TRUE(flags("TVXHBA_FCPort", "LocationIndicator") & FLAG_WRITE);
  EXPECT_TRUE(flags("TVXHBA_FCPort", "LocationIndicator") & FLAG_EXPERIMENTAL);
  EXPECT_TRUE(flags("TVXHBA_ProviderConfigSetting", "current") & FLAG_WRITE);
  EXPECT_TRUE(flags("TVXHBA_DumpData", "DumpDirectory") & FLAG_WRITE);
  EXPECT_FALSE(flags("TVXHBA_DumpData", "ElementName") & FLAG_WRITE);
  EXPECT_TRUE(flags("TVXHBA_FCPortStatistics", "LIPCount") & FLAG_COUNTER);
  EXPECT_TRUE(flags("TVXHBA_RecordLog", "CurrentNumberOfRecords") & FLAG_GAUGE);
  EXPECT_TRUE(flags("TVXHBA_SystemDevice", "GroupComponent") & FLAG_AGGREGATE);
  EXPECT_TRUE(flags("TVXHBA_SystemDevice", "PartComponent") & FLAG_WEAK);
  EXPECT_TRUE(flags("TVXHBA_RegisteredProfile", "RegisteredName") & FLAG_REQUIRED);
  EXPECT_TRUE(flags("TVXHBA_DumpService", "ChangeAffectedElementsAssignedSequence") &
              FLAG_EXPERIMENTAL);
}

struct Added {
  const char* class_name;
  std::size_t properties;
};

/// Numbers of properties that the provider's classes have beyond their superclasses.
constexpr Added added[] = {
    {"TVXHBA_Card", 5},
    {"TVXHBA_Chip", 6},
    {"TVXHBA_ConcreteJob", 2},
    {"TVXHBA_DiagnosticCompletionRecord", 12},
    {"TVXHBA_DiagnosticServiceRecord", 12},
    {"TVXHBA_DriverParamGlobal", 9},
    {"TVXHBA_DriverParams", 11},
    {"TVXHBA_DumpData", 2},
    {"TVXHBA_EnabledRecordLogCapabilities", 1},
    {"TVXHBA_FCHBADiagnosticSettingData", 1},
    {"TVXHBA_FCPort", 7},
    {"TVXHBA_FCPortStatistics", 10},
    {"TVXHBA_FRUVitalProductData", 11},
    {"TVXHBA_FirmwareElementSoftwareIdentity", 1},
    {"TVXHBA_FlashImageSoftwareIdentity", 9},
    {"TVXHBA_LogEntry", 1},
    {"TVXHBA_LogicalDisk", 4},
    {"TVXHBA_PCIDevice", 71},
    {"TVXHBA_ProviderConfigSetting", 5},
    {"TVXHBA_RecordLog", 3},
    {"TVXHBA_SCSIArbitraryLogicalUnit", 3},
    {"TVXHBA_SCSIProtocolEndpoint", 7},
    {"TVXHBA_SCSIProtocolInitiatorEndpoint", 7},
    {"TVXHBA_SoftwareIdentity", 20},
    {"TVXHBA_StorageExtent", 4},
    {"TVXHBA_StorageVolume", 4},
    {"TVXHBA_TapeDrive", 4},
    {"TVXHBA_Transceiver", 32},
    {"TVXHBA_VMSystemDevice", 2},
    {"TVXHBA_VirtualFCPort", 3},
    {"TVXHBA_VitalProductData", 19},
};

TEST(Catalogue, AClassHasItsSuperclassesPropertiesAndTheOnesItAdds) {
  for (const Catalogue_Row& row : catalogue) {
    const auto* own = std::ranges::find_if(
        added, [&](const Added& a) { return std::strcmp(a.class_name, row.name) == 0; });
    const std::size_t expected = own == std::end(added) ? 0 : own->properties;
    const Meta_Class* meta_class = class_named(row.name);
    EXPECT_EQ(row.properties, count(meta_class->super_meta_class, FLAG_PROPERTY) + expected)
        << row.name;
  }
}

}  // namespace
}  // namespace cimrt::test
