// What the host programs are told of the classes is what the provider knows of them.
#include <gtest/gtest.h>

#include <set>
#include <span>
#include <string>

#include "cmpi/cmpidt.h"
#include "runtime/Instance.h"
#include "schema/ClassData.h"
#include "schema/catalogue.h"
#include "schema/meta_walk.h"

namespace cimrt::test {
namespace {

using tvx::host::allClassCount;
using tvx::host::allClasses;
using tvx::host::ClassData;
using tvx::host::FeatureData;
using tvx::host::MethodData;

/// CMPI type by type code, boolean to datetime.
constexpr CMPIType CMPI_TYPES[NUM_TYPES] = {
    CMPI_boolean, CMPI_uint8,  CMPI_sint8,  CMPI_uint16, CMPI_sint16, CMPI_uint32, CMPI_sint32,
    CMPI_uint64,  CMPI_sint64, CMPI_real32, CMPI_real64, CMPI_char16, CMPI_string, CMPI_dateTime};

std::span<const ClassData> classes() {
  return {allClasses, allClassCount};
}

std::span<const FeatureData> features_of(const ClassData& data) {
  return {data.features, data.featureCount};
}

void expect_same(const FeatureData& data, const Meta_Feature* feature) {
  SCOPED_TRACE(data.name);
  EXPECT_STREQ(data.name, feature->name);
  EXPECT_EQ(data.isKey, (feature->flags & FLAG_KEY) != 0);
  EXPECT_EQ(data.isIn, (feature->flags & FLAG_IN) != 0);
  EXPECT_EQ(data.isOut, (feature->flags & FLAG_OUT) != 0);
  EXPECT_EQ(data.isWritable, (feature->flags & FLAG_WRITE) != 0);
  if (is_property(feature)) {
    EXPECT_EQ(data.cmpiType, CMPI_TYPES[as_property(feature)->type]);
    EXPECT_EQ(data.isArray, as_property(feature)->subscript != 0);
    EXPECT_EQ(data.defaultText != nullptr, as_property(feature)->value != nullptr);
    EXPECT_EQ(data.refClass, nullptr);
    return;
  }
  const bool embedded = (feature->flags & (FLAG_EMBEDDED_INSTANCE | FLAG_EMBEDDED_OBJECT)) != 0;
  EXPECT_EQ(data.cmpiType, embedded ? CMPI_instance : CMPI_ref);
  EXPECT_EQ(data.isArray, as_reference(feature)->subscript != 0);
  const Meta_Class* target = as_reference(feature)->meta_class;
  EXPECT_STREQ(data.refClass, target == &Instance::static_meta_class ? nullptr : target->name);
}

void expect_same(const MethodData& data, const Meta_Method* method) {
  SCOPED_TRACE(data.name);
  EXPECT_STREQ(data.name, method->name);
  EXPECT_EQ(data.returnType, CMPI_TYPES[method->return_type]);
  ASSERT_EQ(data.parameterCount + 1, method->num_meta_features);
  for (std::size_t i = 0; i < data.parameterCount; ++i) {
    expect_same(data.parameters[i], method->meta_features[i]);
  }
}

TEST(HostClassData, DescribesEveryClassOnce) {
  std::set<std::string> names;
  for (const ClassData& data : classes()) EXPECT_TRUE(names.insert(data.name).second) << data.name;
  EXPECT_EQ(names.size(), meta_repository.num_meta_classes);
}

TEST(HostClassData, AgreesWithTheProvidersMetaData) {
  for (const ClassData& data : classes()) {
    SCOPED_TRACE(data.name);
    const Meta_Class* meta_class = class_named(data.name);
    ASSERT_NE(meta_class, nullptr);
    const Meta_Class* super = meta_class->super_meta_class;
    EXPECT_STREQ(data.superName, super ? super->name : nullptr);
    EXPECT_EQ(data.isAssociation, (meta_class->flags & FLAG_ASSOCIATION) != 0);
    EXPECT_EQ(data.isAggregation, (meta_class->flags & FLAG_AGGREGATION) != 0);
    EXPECT_EQ(data.isAbstract, (meta_class->flags & FLAG_ABSTRACT) != 0);
    EXPECT_EQ(data.isIndication, (meta_class->flags & FLAG_INDICATION) != 0);
    std::size_t feature = 0, method = 0;
    for (const Meta_Feature* described : test::features_of(meta_class)) {
      if (is_method(described)) {
        ASSERT_LT(method, data.methodCount);
        expect_same(data.methods[method++], as_method(described));
      } else {
        ASSERT_LT(feature, data.featureCount);
        expect_same(data.features[feature++], described);
      }
    }
    EXPECT_EQ(feature, data.featureCount);
    EXPECT_EQ(method, data.methodCount);
  }
}

/// Profiles and the references between them are looked for in the interop namespace.
const std::set<std::string> interop_classes = {
    "TVXHBA_RegisteredProfile", "TVXHBA_ReferencedProfile", "TVXHBA_BaseServerReferencedProfile"};

TEST(HostClassData, MarksTheServedClassesWithTheirNamespace) {
  std::set<std::string> served, expected;
  for (const Catalogue_Row& row : catalogue) expected.insert(row.name);
  for (const ClassData& data : classes()) {
    if (data.isServed) served.insert(data.name);
    const char* own = interop_classes.contains(data.name) ? "root/pg_interop" : "root/torvex";
    EXPECT_STREQ(data.nameSpace, data.isServed ? own : nullptr) << data.name;
  }
  EXPECT_EQ(served, expected);
}

const FeatureData* feature_named(const ClassData& data, const std::string& name) {
  for (const FeatureData& feature : features_of(data)) {
    if (name == feature.name) return &feature;
  }
  return nullptr;
}

TEST(HostClassData, NamesTheClassThatIntroducedAFeature) {
  for (const ClassData& data : classes()) {
    if (std::string(data.name) != "TVXHBA_FCPort") continue;
    EXPECT_STREQ(feature_named(data, "FabricName")->originClass, "TVXHBA_FCPort");
    EXPECT_STREQ(feature_named(data, "DeviceID")->originClass, "CIM_LogicalDevice");
    EXPECT_STREQ(feature_named(data, "PortNumber")->originClass, "CIM_NetworkPort");
    EXPECT_STREQ(feature_named(data, "EnabledState")->defaultText, "5");
    EXPECT_TRUE(feature_named(data, "LocationIndicator")->isWritable);
    return;
  }
  FAIL() << "TVXHBA_FCPort is missing";
}

TEST(HostClassData, WritesDefaultsAsTheDescriptionDoes) {
  for (const ClassData& data : classes()) {
    if (std::string(data.name) != "TVXHBA_ResourcePool") continue;
    EXPECT_STREQ(feature_named(data, "ConsumedResourceUnits")->defaultText, "\"count\"");
    EXPECT_STREQ(feature_named(data, "Primordial")->defaultText, "false");
    return;
  }
  FAIL() << "TVXHBA_ResourcePool is missing";
}

}  // namespace
}  // namespace cimrt::test
