#include "Test_Classes.h"

#include "cmpi/cmpidt.h"

namespace tvx::host {
namespace {

constexpr FeatureData property(const char* name, CMPIType type, const char* origin,
                               bool array = false) {
  return {name, type, array, false, true, false, false, nullptr, nullptr, origin};
}

constexpr FeatureData key(const char* name, CMPIType type, const char* origin) {
  return {name, type, false, true, true, false, false, nullptr, nullptr, origin};
}

constexpr FeatureData reference(const char* name, const char* target, bool isKey) {
  return {name, CMPI_ref, false, isKey, true, false, false, target, nullptr, "FAKE_Link"};
}

constexpr FeatureData parameter(const char* name, CMPIType type, bool array, bool in, bool out,
                                const char* target = nullptr) {
  return {name, type, array, false, in, out, false, target, nullptr, nullptr};
}

constexpr FeatureData thingFeatures[] = {property("Caption", CMPI_string, "CIM_Thing")};

constexpr FeatureData widgetFeatures[] = {
    property("Caption", CMPI_string, "CIM_Thing"),
    key("Name", CMPI_string, "FAKE_Widget"),
    key("Number", CMPI_uint32, "FAKE_Widget"),
    {"Color", CMPI_string, false, false, true, false, true, nullptr, "\"red\"", "FAKE_Widget"},
    property("Sizes", CMPI_uint16, "FAKE_Widget", true),
    property("Stamp", CMPI_dateTime, "FAKE_Widget"),
    property("Ratio", CMPI_real32, "FAKE_Widget"),
    property("Flag", CMPI_boolean, "FAKE_Widget"),
    {"Peer", CMPI_ref, false, false, true, false, false, "FAKE_Widget", nullptr, "FAKE_Widget"},
    {"Inner", CMPI_instance, false, false, true, false, false, "FAKE_Widget", nullptr,
     "FAKE_Widget"}};

constexpr FeatureData linkFeatures[] = {reference("Antecedent", "FAKE_Widget", true),
                                        reference("Dependent", "FAKE_Widget", true),
                                        property("Strength", CMPI_uint8, "FAKE_Link")};

constexpr FeatureData foreignFeatures[] = {
    key("Id", CMPI_string, "FAKE_Foreign"),
    property("Level", CMPI_uint16, "FAKE_Foreign"),
    property("Levels", CMPI_sint8, "FAKE_Foreign", true),
    {"Widget", CMPI_ref, false, false, true, false, false, "FAKE_Widget", nullptr, "FAKE_Foreign"}};

constexpr FeatureData paintParameters[] = {
    parameter("Color", CMPI_string, false, true, false),
    parameter("Coats", CMPI_uint16, false, true, true),
    parameter("Target", CMPI_ref, false, true, false, "FAKE_Widget"),
    parameter("Data", CMPI_uint8, true, true, false),
    parameter("Setting", CMPI_instance, false, true, false, "FAKE_Widget"),
    parameter("Words", CMPI_string, true, true, false),
    parameter("Targets", CMPI_ref, true, true, false, "FAKE_Widget"),
    parameter("Small", CMPI_sint8, false, true, false),
    parameter("Big", CMPI_uint64, false, true, false),
    parameter("Share", CMPI_real64, false, true, false),
    parameter("On", CMPI_boolean, false, true, false),
    parameter("When", CMPI_dateTime, false, true, false),
    parameter("Letter", CMPI_char16, false, true, false),
    parameter("Log", CMPI_string, true, false, true)};

constexpr FeatureData misbehaveParameters[] = {parameter("How", CMPI_string, false, true, false)};

constexpr MethodData widgetMethods[] = {
    {"Paint", CMPI_uint32, paintParameters, std::size(paintParameters), "FAKE_Widget"},
    {"Misbehave", CMPI_uint32, misbehaveParameters, std::size(misbehaveParameters), "FAKE_Widget"}};

constexpr ClassData classOf(const char* name, const char* super, bool association,
                            const char* nameSpace, const FeatureData* features,
                            std::size_t featureCount, const MethodData* methods = nullptr,
                            std::size_t methodCount = 0) {
  return {name,
          super,
          association,
          false,
          nameSpace == nullptr && super == nullptr,
          false,
          nameSpace != nullptr,
          nameSpace,
          features,
          featureCount,
          methods,
          methodCount};
}

}  // namespace

extern const ClassData allClasses[] = {
    classOf("CIM_Thing", nullptr, false, nullptr, thingFeatures, std::size(thingFeatures)),
    classOf("FAKE_Widget", "CIM_Thing", false, "root/fake", widgetFeatures,
            std::size(widgetFeatures), widgetMethods, std::size(widgetMethods)),
    classOf("FAKE_Gadget", "FAKE_Widget", false, "root/fake", widgetFeatures,
            std::size(widgetFeatures), widgetMethods, std::size(widgetMethods)),
    classOf("FAKE_Link", nullptr, true, "root/fake", linkFeatures, std::size(linkFeatures)),
    classOf("FAKE_Foreign", "CIM_Thing", false, nullptr, foreignFeatures,
            std::size(foreignFeatures))};
extern const std::size_t allClassCount = std::size(allClasses);

namespace test {

const ClassCatalogue& testClasses() {
  static const ClassCatalogue classes(allClasses, allClassCount);
  return classes;
}

}  // namespace test
}  // namespace tvx::host
