// The default values of the schema, by name, in every class that has the property.
#include <gtest/gtest.h>

#include <cstring>
#include <map>
#include <string>
#include <variant>

#include "schema/meta_walk.h"

namespace cimrt::test {
namespace {

struct Default {
  const char* name;
  Type type;
  std::variant<std::uint64_t, const char*> value;
  std::size_t entries;  ///< classes whose property of this name has the default
};

constexpr std::uint64_t number(std::uint64_t n) {
  return n;
}

/// A class counts for its own property and for an inherited one.
const Default defaults[] = {
    {"AccessContext", UINT16, number(0), 2},
    {"ConsumedResourceUnits", STRING, "count", 2},
    {"EchoMechanism", UINT32, number(2), 2},
    {"EnabledDefault", UINT16, number(2), 56},
    {"EnabledState", UINT16, number(5), 56},
    {"ErrorSourceFormat", UINT16, number(0), 1},
    {"IsComposite", BOOLEAN, number(1), 6},
    {"IsEntity", BOOLEAN, number(0), 4},
    {"IsLargeBuildNumber", BOOLEAN, number(0), 4},
    {"IsMaximum", UINT16, number(0), 9},
    {"IsMinimum", UINT16, number(0), 9},
    {"IsPending", UINT16, number(0), 9},
    {"JobRunTimes", UINT32, number(1), 3},
    {"LUN", UINT64, number(0), 2},
    {"LogState", UINT16, number(4), 5},
    {"NameFormat", UINT16, number(12), 2},
    {"NameNamespace", UINT16, number(8), 2},
    {"NonDestructive", BOOLEAN, number(0), 3},
    {"OverwritePolicy", UINT16, number(0), 5},
    {"PingMechanism", UINT16, number(2), 2},
    {"PortAvailability", UINT16, number(2), 3},
    {"Primordial", BOOLEAN, number(0), 8},
    {"QueryTimeout", UINT32, number(0), 3},
    {"RemovalConditions", UINT16, number(2), 10},
    {"RequestedState", UINT16, number(12), 56},
    {"SampleInterval", DATETIME, "00000000000000.000000:000", 4},
    {"SupportedTestWarnings", UINT16, number(3), 3},
    {"TimeBeforeRemoval", DATETIME, "00000000000500.000000:000", 2},
    {"TransitioningToState", UINT16, number(12), 56},
};

/// Bytes of a number's default by type code.
std::uint64_t read_number(const Meta_Property* property) {
  static constexpr std::size_t widths[NUM_TYPES] = {1, 1, 1, 2, 2, 4, 4, 8, 8, 4, 8, 2, 8, 8};
  std::uint64_t value = 0;
  std::memcpy(&value, property->value->data, widths[property->type]);
  return value;
}

void expect_value(const Meta_Property* property, const Default& expected) {
  EXPECT_EQ(property->type, expected.type);
  EXPECT_EQ(property->value->size, 1u);
  if (const auto* text = std::get_if<const char*>(&expected.value)) {
    EXPECT_STREQ(static_cast<const char*>(property->value->data), *text);
  } else {
    EXPECT_EQ(read_number(property), std::get<std::uint64_t>(expected.value));
  }
}

/// Number of classes in which each property name has a default; checks the values on the way.
std::map<std::string, std::size_t> check_values() {
  std::map<std::string, std::size_t> found;
  for (const Meta_Class* meta_class : all_classes()) {
    for (const Meta_Feature* feature : features_of(meta_class)) {
      if (!is_property(feature) || !as_property(feature)->value) continue;
      SCOPED_TRACE(std::string(meta_class->name) + "." + feature->name);
      ++found[feature->name];
      for (const Default& expected : defaults) {
        if (std::strcmp(expected.name, feature->name) == 0) {
          expect_value(as_property(feature), expected);
        }
      }
    }
  }
  return found;
}

TEST(Defaults, StandOnTheListedPropertiesWithTheirValuesAndNowhereElse) {
  std::map<std::string, std::size_t> expected;
  for (const Default& row : defaults) expected[row.name] = row.entries;
  EXPECT_EQ(check_values(), expected);
}

TEST(Defaults, AnOverrideWithoutADefaultKeepsTheInheritedOne) {
  const Meta_Property* own = find_property(class_named("CIM_ProtocolEndpoint"), "EnabledState");
  const Meta_Property* inherited =
      find_property(class_named("CIM_EnabledLogicalElement"), "EnabledState");
  EXPECT_NE(own, inherited);
  ASSERT_NE(own->value, nullptr);
  EXPECT_EQ(read_number(own), 5u);
}

TEST(Defaults, ASettingsCopyOfAJobPropertyHasNone) {
  EXPECT_EQ(find_property(class_named("TVXHBA_JobSettingData"), "JobRunTimes")->value, nullptr);
  EXPECT_EQ(find_property(class_named("TVXHBA_StorageVolume"), "NameFormat")->value, nullptr);
}

TEST(Defaults, NoMethodParameterHasOne) {
  for (const Meta_Class* meta_class : all_classes()) {
    for (const Meta_Method* method : methods_of(meta_class)) {
      for (const Meta_Feature* parameter : features_of(method)) {
        if (is_property(parameter)) {
          EXPECT_EQ(as_property(parameter)->value, nullptr);
        }
      }
    }
  }
}

}  // namespace
}  // namespace cimrt::test
