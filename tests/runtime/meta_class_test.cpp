#include "runtime/Meta_Class.h"

#include <gtest/gtest.h>

#include <cstring>
#include <string>

#include "Test_Schema.h"
#include "runtime/Instance.h"

namespace cimrt {
namespace {

using namespace test;

const Meta_Class* const device = &T_Device::static_meta_class;
const Meta_Class* const port = &T_Port::static_meta_class;

TEST(MetaClass, IsFoundByNameIgnoringCase) {
  EXPECT_EQ(find_meta_class(&repository, "T_Device"), device);
  EXPECT_EQ(find_meta_class(&repository, "t_port"), port);
  EXPECT_EQ(find_meta_class(&repository, "T_Unknown"), nullptr);
  EXPECT_EQ(find_meta_class(&repository, ""), nullptr);
  EXPECT_EQ(find_meta_class(nullptr, "T_Device"), nullptr);
  EXPECT_EQ(find_meta_class(&repository, "Instance"), nullptr);
}

TEST(MetaClass, FeaturesAreFoundByNameIgnoringCaseAndByKind) {
  EXPECT_STREQ(find_property(device, "caption")->name, "Caption");
  EXPECT_EQ(find_property(device, "Reset"), nullptr);
  EXPECT_STREQ(find_method(device, "RESET")->name, "Reset");
  EXPECT_EQ(find_feature(device, "reset", FLAG_PROPERTY | FLAG_REFERENCE), nullptr);
  EXPECT_EQ(find_feature(device, ""), nullptr);
}

TEST(MetaClass, AReferenceIsNoPropertyButAFeature) {
  const Meta_Class* link = &T_Link::static_meta_class;
  EXPECT_EQ(find_property(link, "Antecedent"), nullptr);
  EXPECT_NE(find_reference(link, "Antecedent"), nullptr);
  EXPECT_EQ(find_feature(link, "antecedent", 7), find_reference(link, "Antecedent"));
}

TEST(MetaClass, WithoutFeaturesAnswersNullToEveryLookUp) {
  const Meta_Class* empty = &T_Empty::static_meta_class;
  EXPECT_EQ(find_feature(empty, "Name"), nullptr);
  EXPECT_EQ(find_property(empty, "Name"), nullptr);
  EXPECT_EQ(find_reference(empty, "Name"), nullptr);
  EXPECT_EQ(find_method(empty, "Name"), nullptr);
  EXPECT_FALSE(has_feature(empty, 0xFFFFFFFFu));
}

TEST(MetaClass, ParametersAreFeaturesOfTheMethod) {
  const Meta_Method* reset = find_method(device, "Reset");
  EXPECT_NE(find_property(reset, "mode"), nullptr);
  EXPECT_STREQ(reset->meta_features[reset->num_meta_features - 1]->name, "return_value");
}

TEST(MetaClass, HasFeatureLooksForAFlag) {
  EXPECT_TRUE(has_feature(device, FLAG_KEY));
  EXPECT_TRUE(has_feature(device, FLAG_METHOD));
  EXPECT_FALSE(has_feature(device, FLAG_REFERENCE));
  EXPECT_TRUE(has_feature(&T_Group::static_meta_class, FLAG_EMBEDDED_INSTANCE));
}

TEST(MetaClass, EverythingDescendsFromInstance) {
  EXPECT_TRUE(is_subclass(&Instance::static_meta_class, device));
  EXPECT_TRUE(is_subclass(&Instance::static_meta_class, nullptr));
  Meta_Class* same_name = create_meta_class("instance", nullptr, FLAG_CLASS);
  EXPECT_TRUE(is_subclass(same_name, nullptr));
  unref(same_name);
}

TEST(MetaClass, IsSubclassWalksUpTheChain) {
  EXPECT_TRUE(is_subclass(device, device));
  EXPECT_TRUE(is_subclass(device, port));
  EXPECT_FALSE(is_subclass(port, device));
  EXPECT_FALSE(is_subclass(device, nullptr));
  EXPECT_FALSE(is_subclass(nullptr, device));
}

TEST(MetaClass, AClassMadeAtRunTimeDescendsByName) {
  Meta_Class* copy = clone(port);
  EXPECT_TRUE(is_subclass(port, copy));
  EXPECT_TRUE(is_subclass(copy, port));
  EXPECT_TRUE(is_subclass(device, copy));
  unref(copy);
}

TEST(MetaClass, IsSubclassByNamesTellsTheThreeAnswersApart) {
  EXPECT_EQ(is_subclass(&repository, "T_Device", "t_port"), 0);
  EXPECT_EQ(is_subclass(&repository, "T_Port", "T_Device"), 1);
  EXPECT_EQ(is_subclass(&repository, "T_Unknown", "T_Device"), -1);
  EXPECT_EQ(is_subclass(&repository, "T_Device", "T_Unknown"), -1);
  EXPECT_EQ(is_subclass(nullptr, "T_Device", "T_Port"), -1);
  EXPECT_EQ(is_subclass(&repository, nullptr, "T_Port"), -1);
  EXPECT_EQ(is_subclass(&repository, "T_Device", nullptr), -1);
}

TEST(MetaClass, FindDependentSearchesTheClassItsAncestorsAndItsRepository) {
  EXPECT_EQ(find_dependent(port, "t_port"), port);
  EXPECT_EQ(find_dependent(port, "T_Device"), device);
  EXPECT_EQ(find_dependent(port, "T_Link"), &T_Link::static_meta_class);
  EXPECT_EQ(find_dependent(port, "T_Unknown"), nullptr);
  Meta_Class* alone = clone(port);
  EXPECT_EQ(find_dependent(alone, "T_Device"), device);
  EXPECT_EQ(find_dependent(alone, "T_Link"), nullptr);
  unref(alone);
}

TEST(MetaClass, StaticClassesAreNeitherCountedNorFreed) {
  ref(device);
  EXPECT_EQ(device->refs.load(), 0u);
  unref(device);
  unref(device);
  EXPECT_EQ(device->refs.load(), 0u);
  destroy(const_cast<Meta_Class*>(device));
  EXPECT_STREQ(device->name, "T_Device");
  unref(static_cast<const Meta_Feature*>(nullptr));
}

TEST(MetaClass, OfInstanceIsARootWithoutFeatures) {
  const Meta_Class& root = Instance::static_meta_class;
  EXPECT_STREQ(root.name, "Instance");
  EXPECT_EQ(root.flags, static_cast<std::uint32_t>(FLAG_CLASS));
  EXPECT_EQ(root.num_meta_features, 0u);
  EXPECT_EQ(root.size, 24u);
  EXPECT_EQ(root.super_meta_class, nullptr);
  EXPECT_EQ(root.meta_repository, nullptr);
}

/// Lays features out anew and compares each offset and the size of the record.
void expect_layout_rule(const Meta_Record* record) {
  std::size_t at = sizeof(Instance);
  const auto take = [&](std::size_t width, std::size_t alignment) {
    at = (at + alignment - 1) / alignment * alignment;
    const std::size_t offset = at;
    at += width;
    return offset;
  };
  for (std::uint64_t i = 0; i < record->num_meta_features; ++i) {
    const Meta_Feature* f = record->meta_features[i];
    if (is_property(f)) {
      const Meta_Property* p = as_property(f);
      const std::size_t w = type_size_table[p->type];
      EXPECT_EQ(p->offset, p->subscript != 0 ? take(16, 8) : take(2 * w, w)) << f->name;
    } else if (is_reference(f)) {
      const Meta_Reference* r = as_reference(f);
      EXPECT_EQ(r->offset, r->subscript != 0 ? take(16, 8) : take(8, 8)) << f->name;
    }
  }
  EXPECT_EQ(record->size, (at + 7) / 8 * 8) << record->name;
}

TEST(MetaClass, RecordsFollowTheLayoutRule) {
  for (std::uint64_t i = 0; i < repository.num_meta_classes; ++i)
    expect_layout_rule(repository.meta_classes[i]);
  expect_layout_rule(&T_Device_Reset::static_meta_method);
}

TEST(MetaClass, TwoShortsATextAndAWordTake56Bytes) {
  const Meta_Class& mc = T_Layout::static_meta_class;
  EXPECT_EQ(find_property(&mc, "A")->offset, 24u);
  EXPECT_EQ(find_property(&mc, "B")->offset, 28u);
  EXPECT_EQ(find_property(&mc, "C")->offset, 32u);
  EXPECT_EQ(find_property(&mc, "D")->offset, 48u);
  EXPECT_EQ(mc.size, 56u);
}

TEST(MetaClass, InheritedFeaturesKeepTheirOffsetAndObject) {
  for (std::uint64_t i = 0; i < device->num_meta_features; ++i)
    EXPECT_EQ(port->meta_features[i], device->meta_features[i]);
}

TEST(MetaClass, FlagNamesStandAtTheirBits) {
  EXPECT_STREQ(flag_names[0], "Property");
  EXPECT_STREQ(flag_names[7], "Association");
  EXPECT_STREQ(flag_names[12], "EmbeddedObject");
  EXPECT_STREQ(flag_names[19], "Indication");
  EXPECT_STREQ(flag_names[21], "Key");
  EXPECT_STREQ(flag_names[25], "Read");
  EXPECT_STREQ(flag_names[31], "EmbeddedInstance");
  EXPECT_EQ(FLAG_KEY, 1u << 21);
  EXPECT_EQ(FLAG_EMBEDDED_INSTANCE, 1u << 31);
}

}  // namespace
}  // namespace cimrt
