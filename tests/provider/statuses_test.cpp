// What the providers of the library answer, as the server gets it and as the trace log tells it:
// every status that one of them has, and what of a request is left out with no more than a line.
#include <dlfcn.h>

#include <fstream>
#include <map>
#include <sstream>

#include "Failing_Allocations.h"
#include "Traced_Library.h"
#include "runtime/Provider_Operations.h"
#include "tvxsim/tvxsim.h"

namespace tvx::test {
namespace {

using host::Instance;
using host::NamedValues;
using host::ObjectPath;
using host::Reply;
using host::Value;
using Lines = std::vector<std::string>;

constexpr const char* HOST = R"({
  "cards": [{"serial_number": "A", "ports": [{"wwpn": "10000000000000A1",
    "driver_params": [{"name": "depth", "low": 1, "high": 512, "current": 30}],
    "targets": [{"wwpn": "50060E801049CF51", "luns": {"count": 2}}]}]}]})";

class Statuses : public Traced_Library {
 protected:
  void SetUp() override {
    Traced_Library::SetUp();
    useScenario(HOST);
    instances("TVXHBA_SCSIProtocolEndpoint");  // takes the SAN's data in
  }
  ObjectPath first(const char* className) { return instances(className).at(0).path; }
  Instance unit(const std::string& id) {
    Instance made;
    made.path = {"", "root/torvex", "TVXHBA_DriverParams", {{"InstanceID", Value::string(id)}}};
    made.properties.set("InstanceID", Value::string(id));
    return made;
  }
  Reply change(const char* className, const char* property, const Value& value) {
    Instance changed = instances(className).at(0);
    changed.properties.set(property, value);
    std::filesystem::resize_file(root / ".cimrt/messages", 0);
    return broker->modifyInstance(changed, {{property}});
  }
  Reply call(const ObjectPath& path, const char* method, const NamedValues& arguments = {}) {
    return broker->invokeMethod(path, method, arguments);
  }
};

struct Row {
  const char* operation;
  int code;
  const char* name;
  std::function<Reply()> request;
};

TEST_F(Statuses, OfEveryProviderAreAnsweredWithoutAMessageAndTraced) {
  const Instance marked = unit("TVX:OAS:Driver:10000000000000A1:50060E801049CF51:1");
  const ObjectPath card = first("TVXHBA_Card");
  const Instance sentCard = {card, {}};
  ObjectPath nobody = card;
  nobody.keys.set("Tag", Value::string("nobody"));
  const ObjectPath controller = first("TVXHBA_PortController");
  const ObjectPath service = first("TVXHBA_SoftwareInstallationService");
  const Value port = Value::reference(first("TVXHBA_FCPort"));
  const auto number = [](std::uint64_t n, CMPIType type) { return Value::number(type, n); };
  const Row rows[] = {
      {"getInstance", 0, "CMPI_RC_OK", [&] { return broker->getInstance(card); }},
      {"getInstance", 6, "CMPI_RC_ERR_NOT_FOUND", [&] { return broker->getInstance(nobody); }},
      {"enumInstances", 0, "CMPI_RC_OK", [&] { return broker->enumerateInstances("TVXHBA_Card"); }},
      {"enumInstanceNames", 0, "CMPI_RC_OK",
       [&] { return broker->enumerateInstanceNames("TVXHBA_Card"); }},

      {"createInstance", 0, "CMPI_RC_OK", [&] { return broker->createInstance(marked); }},
      {"createInstance", 11, "CMPI_RC_ERR_ALREADY_EXISTS",
       [&] { return broker->createInstance(marked); }},
      {"createInstance", 4, "CMPI_RC_ERR_INVALID_PARAMETER",
       [&] { return broker->createInstance(unit("nothing")); }},
      {"createInstance", 1, "CMPI_RC_ERR_FAILED",
       [&] { return broker->createInstance(unit("TVX:OAS:Driver:")); }},
      {"createInstance", 7, "CMPI_RC_ERR_NOT_SUPPORTED",
       [&] { return broker->createInstance(sentCard); }},

      {"deleteInstance", 0, "CMPI_RC_OK", [&] { return broker->deleteInstance(marked.path); }},
      {"deleteInstance", 6, "CMPI_RC_ERR_NOT_FOUND",
       [&] { return broker->deleteInstance(marked.path); }},
      {"deleteInstance", 1, "CMPI_RC_ERR_FAILED",
       [&] { return broker->deleteInstance(unit("10000000000000A1:depth").path); }},
      {"deleteInstance", 7, "CMPI_RC_ERR_NOT_SUPPORTED",
       [&] { return broker->deleteInstance(card); }},

      {"modifyInstance", 0, "CMPI_RC_OK",
       [&] { return change("TVXHBA_FCPort", "LocationIndicator", number(2, CMPI_uint16)); }},
      {"modifyInstance", 4, "CMPI_RC_ERR_INVALID_PARAMETER",
       [&] { return change("TVXHBA_FCPort", "LocationIndicator", number(4, CMPI_uint16)); }},
      {"modifyInstance", 1, "CMPI_RC_ERR_FAILED",
       [&] { return change("TVXHBA_DumpData", "RetentionCount", number(21, CMPI_uint32)); }},
      {"modifyInstance", 7, "CMPI_RC_ERR_NOT_SUPPORTED",
       [&] { return broker->modifyInstance(sentCard); }},

      {"invokeMethod", 0, "CMPI_RC_OK",
       [&] {
         return call(service, "GetHBAFeatures", {{"Target", port}});
       }},
      {"invokeMethod", 7, "CMPI_RC_ERR_NOT_SUPPORTED", [&] { return call(controller, "Reset"); }},
      {"invokeMethod", 17, "CMPI_RC_ERR_METHOD_NOT_FOUND Fly",
       [&] { return call(controller, "Fly"); }},
      {"execQuery", 7, "CMPI_RC_ERR_NOT_SUPPORTED",
       [&] { return broker->execQuery("TVXHBA_Card", "q", "l"); }},
  };
  // Making an interface has lines of its own.
  for (const char* name : {"TVXHBA_DriverParams", "TVXHBA_DumpData", "TVXHBA_PortController",
                           "TVXHBA_SoftwareInstallationService"})
    for (const auto kind : {host::InterfaceKind::Instance, host::InterfaceKind::Method})
      ASSERT_NE(broker->interface(name, kind), nullptr) << name;
  for (const Row& row : rows) {
    const std::string start = std::string(row.operation) + "()";
    call(controller, "Fly");  // the interfaces of methods are made
    Lines lines = linesOf(row.request, row.code);
    EXPECT_EQ(lines, (Lines{"DBG: enter: " + start, "DBG: return: " + start + ": " + row.name}));
  }
}

// ---- What fails inside and is a success outside

TEST_F(Statuses, ABeaconThatTheAdapterDoesNotSwitchIsASuccess) {
  addFault(R"({"call": "LRM_DiagBeacon", "status": 1})");
  const auto refused = [&] {
    return change("TVXHBA_FCPort", "LocationIndicator", Value::number(CMPI_uint16, 2));
  };
  EXPECT_EQ(linesOf(refused, CMPI_RC_OK),
            (Lines{"DBG: enter: modifyInstance()", "DBG: return: modifyInstance(): CMPI_RC_OK"}));
  EXPECT_TRUE(last.done);
  EXPECT_EQ(last.paths.size(), 1U);
  EXPECT_EQ(tvxsim_calls("LRM_DiagBeacon", "10000000000000A1"), 1U);
}

TEST_F(Statuses, AnEnumerationThatRunsOutOfMemoryIsAnEmptySuccessThatOnlyTheLogTells) {
  ASSERT_TRUE(Allocations::watch(TVX_PROVIDER_LIBRARY));
  const std::filesystem::path log = root / "opt/ibm/platform/log/torvex_fc_provider_ffdc.log";
  const std::pair<const char*, const char*> rows[] = {
      {"TVXHBA_Card", "Exception in CIM Provider Enumeration - do nothing"},
      {"TVXHBA_FCPort", "Exception in Active CIM Provider Enumeration - do nothing"},
      {"TVXHBA_StorageVolume", "Exception in SAN CIM Provider Enumeration - do nothing"}};
  for (const auto& [className, text] : rows) {
    ASSERT_FALSE(instances(className).empty());
    int empty = 0;
    bool failed = true;
    for (long number = 0; failed; ++number) {
      std::filesystem::resize_file(log, 0);
      Allocations::failAfter(number);
      const Reply reply = broker->enumerateInstances(className);
      failed = Allocations::stop();
      EXPECT_FALSE(reply.report.leaks()) << reply.report.text();
      if (!failed || reply.status.rc != CMPI_RC_OK || !reply.instances.empty()) continue;
      std::stringstream told;
      told << std::ifstream(log).rdbuf();
      if (told.str().find(text) == std::string::npos) continue;
      EXPECT_TRUE(reply.done);
      ++empty;
    }
    EXPECT_GT(empty, 0) << text;
  }
}

// ---- What of a request is left out with a line

TEST_F(Statuses, PropertiesThatDoNotFitAreToldAndLeftOut) {
  const auto lines = [&](const char* name, const Value& value) {
    Instance sent = unit("TVX:OAS:Driver:10000000000000A1:50060E801049CF51:1");
    sent.properties.set(name, value);
    const Lines told = linesInside([&] { return broker->createInstance(sent); }, CMPI_RC_OK);
    EXPECT_EQ(broker->deleteInstance(sent.path).status.rc, CMPI_RC_OK);
    return told;
  };
  const std::string left = "WARN: unexpected failure: TVXHBA_DriverParams.";
  EXPECT_EQ(lines("Colour", Value::string("red")),
            (Lines{"WARN: unknown feature: TVXHBA_DriverParams.Colour"}));
  EXPECT_EQ(lines("paramno", Value::number(CMPI_uint64, 1)),
            (Lines{"WARN: type mismatch on paramno: uint64/uint32", left + "paramno"}));
  EXPECT_EQ(lines("current", Value::string("1")),
            (Lines{"WARN: type mismatch on current: string/uint32", left + "current"}));
  EXPECT_EQ(lines("help", Value::array(CMPI_string, {Value::null(CMPI_string)})),
            (Lines{"WARN: encountered null array element", left + "help"}));
  EXPECT_EQ(lines("help", Value::array(CMPI_string, {Value::stringWithoutText()})),
            (Lines{"WARN: CMGetCharsPtr() failed",
                   "WARN: type mismatch on help: string_array/string", left + "help"}));
  EXPECT_EQ(lines("help", Value::stringWithoutText()), (Lines{"WARN: CMGetCharsPtr() failed"}));
  EXPECT_EQ(lines("help", Value::null(CMPI_string)), Lines{});
  EXPECT_EQ(lines("help", Value::reference({"", "root/torvex", "No_Such_Class", {}})),
            (Lines{"WARN: failed to find meta class: No_Such_Class", left + "help"}));
}

TEST_F(Statuses, KeysThatDoNotFitAreToldAndFindNothing) {
  const auto lines = [&](const char* name, const Value& value, int code) {
    ObjectPath path = first("TVXHBA_DriverParams");
    path.keys.set(name, value);
    return linesInside([&] { return broker->getInstance(path); }, code);
  };
  EXPECT_EQ(lines("InstanceID", Value::number(CMPI_uint64, 1), CMPI_RC_ERR_NOT_FOUND),
            (Lines{"WARN: type mismatch on InstanceID: sint64/string",
                   "WARN: unexpected failure: TVXHBA_DriverParams.InstanceID"}));
  EXPECT_EQ(lines("Colour", Value::string("red"), CMPI_RC_OK),
            (Lines{"WARN: unknown feature: TVXHBA_DriverParams.Colour"}));
  EXPECT_EQ(lines("current", Value::string("no key"), CMPI_RC_OK), Lines{});
}

TEST_F(Statuses, ArgumentsThatDoNotFitAreToldAndTextsAreRead) {
  const ObjectPath service = first("TVXHBA_SoftwareInstallationService");
  const Value port = Value::reference(first("TVXHBA_FCPort"));
  const auto lines = [&](const char* method, const NamedValues& arguments) {
    return linesInside([&] { return call(service, method, arguments); }, CMPI_RC_OK);
  };
  call(service, "Fly");
  EXPECT_EQ(lines("SetPortEnabled", {{"Target", port}, {"PortEnabled", Value::string("TRUE")}}),
            (Lines{"WARN: converting string to registered parameter type"}));
  EXPECT_EQ(lines("SetPortEnabled", {{"Target", port}, {"PortEnabled", Value::string("tru")}}),
            (Lines{"WARN: type mismatch on PortEnabled: string/boolean",
                   "WARN: unexpected failure: SetPortEnabled.PortEnabled"}));
  EXPECT_EQ(lines("SetPortEnabled", {{"Colour", Value::string("red")}}),
            (Lines{"WARN: unknown feature: SetPortEnabled.Colour"}));
  EXPECT_EQ(lines("GetHBAFeatures", {{"Target", Value::string("port")}}),
            (Lines{"INFO: cast_cmpi_string_to_scalar(): Not supported",
                   "WARN: type mismatch on Target: string/instance",
                   "WARN: unexpected failure: GetHBAFeatures.Target"}));
  EXPECT_EQ(
      lines("GetHBAFeatures", {{"Target", Value::reference({"", "", "No_Such_Class", {}})}}),
      (Lines{"WARN: failed to find meta class: No_Such_Class", "WARN: cmpi_to_cimrt_value() failed",
             "WARN: unexpected failure: GetHBAFeatures.Target"}));
  EXPECT_EQ(
      lines("InstallFromByteStream",
            {{"Target", port}, {"Image", Value::array(CMPI_uint8, {Value::null(CMPI_uint8)})}}),
      (Lines{"WARN: encountered null array element", "WARN: cmpi_to_cimrt_value() failed",
             "WARN: unexpected failure: InstallFromByteStream.Image"}));
}

// ---- Dispatchers, and names of the tables

std::int32_t ask(const cimrt::Registration* entry, std::uint32_t operation, void* place = nullptr) {
  return entry->provider_proc(entry, operation, place, nullptr, nullptr, nullptr, nullptr, nullptr,
                              nullptr, nullptr);
}

TEST_F(Statuses, OperationsThatADispatcherDoesNotHaveAnswerMinusOne) {
  void* library = dlopen(TVX_PROVIDER_LIBRARY, RTLD_NOW | RTLD_NOLOAD);
  ASSERT_NE(library, nullptr);
  using Module = const cimrt::Registration* (*)();
  std::map<std::string, std::size_t> shapes;
  const auto* entry = reinterpret_cast<Module>(dlsym(library, "cimrt_module"))();
  for (; entry; entry = entry->next) {
    const std::string name = entry->provider_name;
    const host::ClassData* each = classes->find(name.substr(0, name.size() - 9));
    ASSERT_NE(each, nullptr) << name;
    const cimrt::Meta_Class* served = nullptr;
    EXPECT_EQ(ask(entry, cimrt::OPERATION_GET_META_CLASS, &served), 0) << name;
    EXPECT_EQ(served, entry->meta_class) << name;
    const cimrt::Meta_Repository* repository = nullptr;
    EXPECT_EQ(ask(entry, cimrt::OPERATION_GET_REPOSITORY, &repository), 0) << name;
    EXPECT_NE(repository, nullptr) << name;
    for (const std::uint32_t operation : {11U, 12U, 17U, 99U, ~0U})
      EXPECT_EQ(ask(entry, operation), -1) << name << " " << operation;
    if (each->methodCount == 0) {
      EXPECT_EQ(ask(entry, cimrt::OPERATION_INVOKE_METHOD), -1) << name;
    }
    if (!each->isAssociation) {
      for (const std::uint32_t operation : {14U, 15U, 16U})
        EXPECT_EQ(ask(entry, operation), -1) << name << " " << operation;
    }
    ++shapes[each->isAssociation ? "association" : each->methodCount ? "with methods" : "plain"];
  }
  EXPECT_EQ(shapes, (std::map<std::string, std::size_t>{
                        {"association", 100}, {"with methods", 30}, {"plain", 22}}));
  dlclose(library);
}

TEST_F(Statuses, OnlyTheInstanceTableOfAClassHasAName) {
  for (const std::string& name : servedClasses()) {
    const auto* instance =
        static_cast<CMPIInstanceMI*>(broker->interface(name, host::InterfaceKind::Instance));
    const auto* method =
        static_cast<CMPIMethodMI*>(broker->interface(name, host::InterfaceKind::Method));
    const auto* association =
        static_cast<CMPIAssociationMI*>(broker->interface(name, host::InterfaceKind::Association));
    EXPECT_EQ(std::string(instance->ft->miName), "association" + name + "_Provider");
    EXPECT_EQ(method->ft->miName, nullptr) << name;
    if (association) {
      EXPECT_EQ(association->ft->miName, nullptr) << name;
    }
  }
}

}  // namespace
}  // namespace tvx::test
