// Records are laid out by one rule; every offset and size is computed again here from it.
#include <gtest/gtest.h>

#include <algorithm>
#include <cstring>
#include <string>

#include "generated/Records.h"
#include "schema/meta_walk.h"
#include "schema/record_offsets.h"

namespace cimrt::test {
namespace {

constexpr std::size_t HEADER_SIZE = 24;
constexpr std::size_t ARRAY_SIZE = 16;
constexpr std::size_t POINTER_SIZE = 8;

struct Storage {
  std::size_t size;
  std::size_t alignment;
};

/// Bytes of one stored value by type code, boolean to datetime.
constexpr std::size_t WIDTHS[NUM_TYPES] = {1, 1, 1, 2, 2, 4, 4, 8, 8, 4, 8, 2, 8, 8};

Storage storage_of(const Meta_Feature* feature) {
  if (is_reference(feature)) {
    return as_reference(feature)->subscript == 0 ? Storage{POINTER_SIZE, POINTER_SIZE}
                                                 : Storage{ARRAY_SIZE, POINTER_SIZE};
  }
  const Meta_Property* property = as_property(feature);
  if (property->subscript != 0) return {ARRAY_SIZE, POINTER_SIZE};
  return {2 * WIDTHS[property->type], WIDTHS[property->type]};
}

std::size_t offset_of(const Meta_Feature* feature) {
  return is_reference(feature) ? as_reference(feature)->offset : as_property(feature)->offset;
}

constexpr std::size_t round_up(std::size_t value, std::size_t alignment) {
  return (value + alignment - 1) / alignment * alignment;
}

void expect_laid_out(const Meta_Record* record) {
  SCOPED_TRACE(record->name);
  std::size_t position = HEADER_SIZE;
  for (const Meta_Feature* feature : features_of(record)) {
    if (is_method(feature)) continue;
    const Storage storage = storage_of(feature);
    position = round_up(position, storage.alignment);
    EXPECT_EQ(offset_of(feature), position) << feature->name;
    position += storage.size;
  }
  EXPECT_EQ(record->size, round_up(position, 8));
}

TEST(Layout, EveryClassFollowsTheRule) {
  for (const Meta_Class* meta_class : all_classes()) expect_laid_out(meta_class);
}

TEST(Layout, EveryMethodRecordFollowsTheRule) {
  for (const Meta_Class* meta_class : all_classes()) {
    SCOPED_TRACE(meta_class->name);
    for (const Meta_Method* method : methods_of(meta_class)) expect_laid_out(method);
  }
}

TEST(Layout, SmallNumbersTakeTwiceTheirWidthAndTextsSixteenBytes) {
  const Meta_Method* method =
      find_method(class_named("TVXHBA_FCHBADriverParamService"), "SetDriverParameter");
  ASSERT_NE(method, nullptr);
  EXPECT_EQ(find_reference(method, "Target")->offset, 24u);
  EXPECT_EQ(find_property(method, "bPermanent")->offset, 32u);
  EXPECT_EQ(find_property(method, "bGlobal")->offset, 34u);
  EXPECT_EQ(find_property(method, "strParam")->offset, 40u);
  EXPECT_EQ(find_property(method, "strValue")->offset, 56u);
  EXPECT_EQ(find_property(method, "return_value")->offset, 72u);
  EXPECT_EQ(method->size, 80u);
}

TEST(Layout, TwoShortsATextAndANumberTakeFiftySixBytes) {
  const Meta_Method* method = find_method(class_named("TVXHBA_RecordLog"), "SetLogParams");
  ASSERT_NE(method, nullptr);
  EXPECT_EQ(find_property(method, "LogLevel")->offset, 24u);
  EXPECT_EQ(find_property(method, "LogMode")->offset, 28u);
  EXPECT_EQ(find_property(method, "TracePath")->offset, 32u);
  EXPECT_EQ(find_property(method, "return_value")->offset, 48u);
  EXPECT_EQ(method->size, 56u);
}

TEST(Layout, TypedRecordsAgreeWithTheDescriptions) {
  EXPECT_EQ(num_record_sizes, meta_repository.num_meta_classes);
  for (std::size_t i = 0; i < num_record_sizes; ++i) {
    const Meta_Class* meta_class = class_named(record_sizes[i].class_name);
    ASSERT_NE(meta_class, nullptr) << record_sizes[i].class_name;
    EXPECT_EQ(record_sizes[i].size, meta_class->size) << meta_class->name;
  }
}

TEST(Layout, TypedFieldsAgreeWithTheDescriptions) {
  std::size_t described = 0;
  for (const Meta_Class* meta_class : all_classes()) {
    described += count(meta_class, FLAG_PROPERTY | FLAG_REFERENCE);
  }
  EXPECT_EQ(num_field_offsets, described);
  for (std::size_t i = 0; i < num_field_offsets; ++i) {
    const Field_Offset& field = field_offsets[i];
    const Meta_Feature* feature =
        find_feature(class_named(field.class_name), field.field, FLAG_PROPERTY | FLAG_REFERENCE);
    ASSERT_NE(feature, nullptr) << field.class_name << "." << field.field;
    EXPECT_EQ(field.offset, offset_of(feature)) << field.class_name << "." << field.field;
  }
}

TEST(Layout, ASubclassRepeatsItsSuperclassesFeaturesAtTheSamePlaces) {
  for (const Meta_Class* meta_class : all_classes()) {
    const Meta_Class* super = meta_class->super_meta_class;
    if (!super) continue;
    SCOPED_TRACE(meta_class->name);
    ASSERT_GE(meta_class->num_meta_features, super->num_meta_features);
    EXPECT_GE(meta_class->size, super->size);
    for (std::size_t i = 0; i < super->num_meta_features; ++i) {
      const Meta_Feature* own = meta_class->meta_features[i];
      const Meta_Feature* inherited = super->meta_features[i];
      EXPECT_STREQ(own->name, inherited->name);
      EXPECT_EQ(own == inherited, meta_class->locals[i] == 0) << own->name;
      if (!is_method(own)) {
        EXPECT_EQ(offset_of(own), offset_of(inherited)) << own->name;
      }
    }
  }
}

TEST(Layout, WhatAClassAddsIsMarkedAsItsOwn) {
  for (const Meta_Class* meta_class : all_classes()) {
    const Meta_Class* super = meta_class->super_meta_class;
    for (std::size_t i = super ? super->num_meta_features : 0; i < meta_class->num_meta_features;
         ++i) {
      EXPECT_EQ(meta_class->locals[i], 1u) << meta_class->name;
    }
  }
}

TEST(Layout, AnOverriddenKeyStaysAKeyInItsPlace) {
  const Meta_Class* meta_class = class_named("TVXHBA_SCSIProtocolEndpoint");
  EXPECT_NE(find_property(meta_class, "Name")->flags & FLAG_KEY, 0u);
  EXPECT_NE(find_property(class_named("CIM_ManagedElement"), "InstanceID"),
            find_property(class_named("CIM_SettingData"), "InstanceID"));
  EXPECT_EQ(find_property(class_named("CIM_ManagedElement"), "InstanceID")->flags & FLAG_KEY, 0u);
  EXPECT_NE(find_property(class_named("CIM_SettingData"), "InstanceID")->flags & FLAG_KEY, 0u);
}

TEST(Layout, AnOverriddenReferenceNamesTheNarrowerClass) {
  const Meta_Class* controlled = class_named("TVXHBA_ControlledBy");
  EXPECT_STREQ(find_reference(controlled, "Antecedent")->meta_class->name, "CIM_Controller");
  EXPECT_STREQ(find_reference(class_named("CIM_Dependency"), "Antecedent")->meta_class->name,
               "CIM_ManagedElement");
  static_assert(std::is_same_v<decltype(TVXHBA_ControlledBy::Antecedent), CIM_Controller*>);
  static_assert(std::is_same_v<decltype(CIM_Dependency::Antecedent), CIM_ManagedElement*>);
}

struct Key_Family {
  const char* class_name;
  std::vector<std::string> keys;
};

TEST(Keys, ComeInTheOrderOfTheClass) {
  const Key_Family families[] = {
      {"TVXHBA_DumpData", {"InstanceID"}},
      {"TVXHBA_RecordLog", {"InstanceID"}},
      {"TVXHBA_ConcreteJob", {"InstanceID"}},
      {"TVXHBA_SoftwareIdentity", {"InstanceID"}},
      {"TVXHBA_DumpService",
       {"Name", "SystemCreationClassName", "SystemName", "CreationClassName"}},
      {"TVXHBA_RemoteServiceAccessPoint",
       {"Name", "SystemCreationClassName", "SystemName", "CreationClassName"}},
      {"TVXHBA_FCPort", {"SystemCreationClassName", "SystemName", "CreationClassName", "DeviceID"}},
      {"TVXHBA_Card", {"Tag", "CreationClassName"}},
      {"TVXHBA_Product", {"Name", "IdentifyingNumber", "Vendor", "Version"}},
      {"TVXHBA_SystemDevice", {"GroupComponent", "PartComponent"}},
      {"TVXHBA_SCSIInitiatorTargetTapeDrivePath", {"Initiator", "Target", "LogicalUnit"}},
  };
  for (const Key_Family& family : families) {
    std::vector<std::string> keys;
    for (const Meta_Feature* feature : features_of(class_named(family.class_name))) {
      if (feature->flags & FLAG_KEY) keys.emplace_back(feature->name);
    }
    EXPECT_EQ(keys, family.keys) << family.class_name;
  }
}

}  // namespace
}  // namespace cimrt::test
