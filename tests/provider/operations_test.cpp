// Every operation on every class of the built library: what a class answers that does nothing
// special, and what it makes of requests that are not well formed.
#include <algorithm>
#include <set>

#include "Provider_Fixture.h"

namespace tvx::test {
namespace {

using host::ClassData;
using host::Instance;
using host::ObjectPath;
using host::Operation;
using host::Reply;
using host::Value;

/// Classes with a provider of their own that lets a client change something.
const std::set<std::string> WRITABLE = {"TVXHBA_FCPort", "TVXHBA_ProviderConfigSetting",
                                        "TVXHBA_DumpData", "TVXHBA_DriverParams"};

/// Classes whose methods act.
const std::set<std::string> ACTING = {
    "TVXHBA_BootBIOSService",
    "TVXHBA_DiagnosticsLog",
    "TVXHBA_DumpService",
    "TVXHBA_FCHBADiagnosticTest",
    "TVXHBA_FCHBADriverParamService",
    "TVXHBA_FCHBAWWNService",
    "TVXHBA_FCPort",
    "TVXHBA_FCTagService",
    "TVXHBA_HelpService",
    "TVXHBA_RecordLog",
    "TVXHBA_RegisteredProfile",
    "TVXHBA_SoftwareInstallationService",
};

class Operations : public Provider_Test {
 protected:
  void SetUp() override {
    Provider_Test::SetUp();
    load();
    for (const std::string& name : servedClasses()) served.push_back(classes->find(name));
  }

  /// A request that must leave nothing behind.
  Reply clean(Reply reply, const std::string& what) {
    EXPECT_FALSE(reply.report.leaks()) << what << "\n" << reply.report.text();
    EXPECT_TRUE(reply.report.complaints.empty()) << what;
    return reply;
  }
  int code(Reply reply, const std::string& what) { return clean(std::move(reply), what).status.rc; }

  /// The first instance, or one of no host.
  Instance someInstance(const ClassData& each) {
    std::vector<Instance> all = instances(each.name);
    if (!all.empty()) return all.front();
    Instance made;
    made.path = nobody(each);
    return made;
  }
  /// A path with keys that no instance has.
  static ObjectPath nobody(const ClassData& each) {
    ObjectPath path{"", each.nameSpace, each.name, {}};
    for (const host::FeatureData& feature : host::features(each)) {
      if (!feature.isKey) continue;
      path.keys.set(feature.name, feature.cmpiType == CMPI_string ? Value::string("nobody")
                                                                  : Value::null(feature.cmpiType));
    }
    return path;
  }

  std::vector<const ClassData*> served;
};

// ---- What a class answers that does nothing special

TEST_F(Operations, AnInstanceThatIsNotThereIsNotFound) {
  for (const ClassData* each : served) {
    EXPECT_EQ(code(broker->getInstance(nobody(*each)), each->name), CMPI_RC_ERR_NOT_FOUND)
        << each->name;
    EXPECT_EQ(code(broker->getInstance({"", each->nameSpace, each->name, {}}), each->name),
              CMPI_RC_ERR_NOT_FOUND)
        << each->name << " without keys";
  }
}

TEST_F(Operations, ChangesAreNotSupported) {
  for (const ClassData* each : served) {
    if (WRITABLE.count(each->name)) continue;
    const Instance some = someInstance(*each);
    EXPECT_EQ(code(broker->createInstance(some), each->name), CMPI_RC_ERR_NOT_SUPPORTED)
        << each->name;
    EXPECT_EQ(code(broker->modifyInstance(some), each->name), CMPI_RC_ERR_NOT_SUPPORTED)
        << each->name;
    EXPECT_EQ(code(broker->deleteInstance(some.path), each->name), CMPI_RC_ERR_NOT_SUPPORTED)
        << each->name;
  }
}

TEST_F(Operations, OnlyTheChangesOfAWritableClassAreSupported) {
  for (const char* name : {"TVXHBA_FCPort", "TVXHBA_ProviderConfigSetting", "TVXHBA_DumpData"}) {
    const Instance some = someInstance(*classes->find(name));
    EXPECT_EQ(code(broker->createInstance(some), name), CMPI_RC_ERR_NOT_SUPPORTED) << name;
    EXPECT_EQ(code(broker->deleteInstance(some.path), name), CMPI_RC_ERR_NOT_SUPPORTED) << name;
  }
  const Instance some = someInstance(*classes->find("TVXHBA_DriverParams"));
  EXPECT_EQ(code(broker->modifyInstance(some), "DriverParams"), CMPI_RC_ERR_NOT_SUPPORTED);
}

TEST_F(Operations, QueriesAreNotSupported) {
  for (const ClassData* each : served) {
    EXPECT_EQ(code(broker->execQuery(each->name, "select *", "WQL"), each->name),
              CMPI_RC_ERR_NOT_SUPPORTED)
        << each->name;
  }
}

TEST_F(Operations, MethodsThatDoNothingAreNotSupported) {
  std::size_t methods = 0;
  for (const ClassData* each : served) {
    if (ACTING.count(each->name)) continue;
    const ObjectPath path = someInstance(*each).path;
    for (const host::MethodData& method : host::methods(*each)) {
      EXPECT_EQ(code(broker->invokeMethod(path, method.name), method.name),
                CMPI_RC_ERR_NOT_SUPPORTED)
          << each->name << "." << method.name;
      ++methods;
    }
  }
  EXPECT_GT(methods, 40U);
}

TEST_F(Operations, AMethodThatTheClassLacksIsNotFound) {
  for (const ClassData* each : served) {
    if (!broker->hasInterface(each->name, host::InterfaceKind::Method)) continue;
    const ObjectPath path = nobody(*each);
    for (const char* name : {"NoSuchMethod", "", "InstanceID", "Caption"}) {
      EXPECT_EQ(code(broker->invokeMethod(path, name), each->name), CMPI_RC_ERR_METHOD_NOT_FOUND)
          << each->name << "." << name;
    }
  }
}

// ---- Associations

TEST_F(Operations, AnUnknownSourceClassIsAnEmptySuccess) {
  std::size_t associations = 0;
  for (const ClassData* each : served) {
    if (!each->isAssociation) continue;
    ++associations;
    host::Request request;
    request.exact = true;
    request.path = {"", "root/torvex", "No_Such_Class", {{"Id", Value::string("a")}}};
    request.assocClass = each->name;
    request.resultClass = each->name;
    for (const Operation operation : {Operation::Associators, Operation::AssociatorNames,
                                      Operation::References, Operation::ReferenceNames}) {
      request.operation = operation;
      const Reply reply = clean(broker->run(request), each->name);
      EXPECT_EQ(reply.status.rc, CMPI_RC_OK) << each->name;
      EXPECT_TRUE(reply.paths.empty() && reply.instances.empty()) << each->name;
    }
  }
  EXPECT_EQ(associations, 100U);
}

bool holds(const std::vector<ObjectPath>& paths, const ObjectPath& wanted) {
  return std::any_of(paths.begin(), paths.end(),
                     [&](const ObjectPath& each) { return each.sameObject(wanted); });
}

/// The references of an association instance, by role.
std::vector<host::NamedValue> endsOf(const Instance& link) {
  std::vector<host::NamedValue> ends;
  for (const host::NamedValue& each : link.properties)
    if (each.value.type() == CMPI_ref && !each.value.isNull()) ends.push_back(each);
  return ends;
}

TEST_F(Operations, EveryEndOfEveryAssociationFindsTheOthersAndTheLink) {
  std::size_t walked = 0;
  for (const ClassData* each : served) {
    if (!each->isAssociation) continue;
    const std::vector<Instance> links = instances(each->name);
    if (links.empty()) continue;
    const std::vector<host::NamedValue> ends = endsOf(links.front());
    ASSERT_GE(ends.size(), 2U) << each->name;
    for (const host::NamedValue& from : ends) {
      const ObjectPath& source = from.value.asReference();
      const Reply names =
          clean(broker->associatorNames(source, each->name, "", from.name), each->name);
      const Reply links_of =
          clean(broker->referenceNames(source, each->name, from.name), each->name);
      EXPECT_TRUE(holds(links_of.paths, links.front().path)) << each->name << " " << from.name;
      for (const host::NamedValue& to : ends) {
        if (to.name == from.name) continue;
        EXPECT_TRUE(holds(names.paths, to.value.asReference()))
            << each->name << " from " << from.name << " to " << to.name;
        // The other end's role is not that of the source.
        EXPECT_FALSE(
            holds(broker->referenceNames(source, each->name, to.name).paths, links.front().path))
            << each->name << " " << to.name;
      }
      ++walked;
    }
  }
  EXPECT_GT(walked, 60U);
}

TEST_F(Operations, AClassThatIsNoAssociationHasNoWalks) {
  for (const ClassData* each : served) {
    EXPECT_EQ(broker->hasInterface(each->name, host::InterfaceKind::Association),
              each->isAssociation)
        << each->name;
  }
}

// ---- Property lists

TEST_F(Operations, APropertyListMayHoldAnything) {
  for (const ClassData* each : served) {
    const std::vector<Instance> whole = instances(each->name);
    if (whole.empty() || whole.front().properties.empty()) continue;
    const std::string first = whole.front().properties[0].name;
    std::string upper = first;
    std::transform(upper.begin(), upper.end(), upper.begin(), ::toupper);
    const std::vector<std::string> list = {
        "NoSuchProperty",    first, first, upper, "InstanceID", "CreationClassName", "",
        "RequestStateChange"};
    const auto listed = [&](const std::string& name) {
      return std::any_of(list.begin(), list.end(),
                         [&](const std::string& one) { return host::sameName(one, name); });
    };
    const std::vector<Instance> some = instances(each->name, list);
    EXPECT_EQ(some.size(), whole.size()) << each->name;
    for (const Instance& instance : some)
      for (const host::NamedValue& property : instance.properties)
        EXPECT_TRUE(listed(property.name)) << each->name << "." << property.name;
    const Reply got = clean(broker->getInstance(whole.front().path, list), each->name);
    ASSERT_EQ(got.instances.size(), 1U) << each->name;
    EXPECT_EQ(got.instances[0].properties, some.front().properties) << each->name;
  }
}

TEST_F(Operations, AnEmptyPropertyListLeavesThePathAlone) {
  for (const ClassData* each : served) {
    for (const Instance& instance : instances(each->name, std::vector<std::string>{})) {
      EXPECT_TRUE(instance.properties.empty()) << each->name;
      EXPECT_FALSE(instance.path.keys.empty()) << each->name;
    }
  }
}

// ---- Values of other types

TEST_F(Operations, AKeyOfAnotherTypeFindsNothing) {
  for (const ClassData* each : served) {
    const std::vector<Instance> all = instances(each->name);
    if (all.empty()) continue;
    for (const host::NamedValue& key : all.front().path.keys) {
      for (const Value& wrong :
           {Value::boolean(true), Value::dateTime("20240229235959.123456+060"),
            Value::real(CMPI_real64, 1.5), Value::null(CMPI_string), Value::number(CMPI_uint64, 1),
            Value::signedNumber(CMPI_sint64, 1), Value::stringWithoutText()}) {
        ObjectPath path = all.front().path;
        path.keys.set(key.name, wrong);
        EXPECT_EQ(code(broker->getInstance(path), each->name), CMPI_RC_ERR_NOT_FOUND)
            << each->name << "." << key.name << " " << wrong.display();
      }
      break;  // one key of each class: every request costs an enumeration
    }
  }
}

/// What a careless client sends in the place of a value of `type`.
std::vector<Value> careless(CMPIType type) {
  return {
      Value::null(type),
      Value::stringWithoutText(),
      Value::string("no such thing"),
      Value::string(""),
      Value::number(CMPI_uint64, ~0ULL),
      Value::signedNumber(CMPI_sint8, -1),
      Value::dateTime("00000002030405.000006:000"),
      Value::reference({"", "root/torvex", "No_Such_Class", {}}),
      Value::array(CMPI_string, {Value::string("a"), Value::null(CMPI_string)}),
      Value::array(CMPI_uint8, {Value::null(CMPI_uint8)}),
      Value::array(CMPI_ref, {}),
      Value::array(CMPI_string, {Value::stringWithoutText()}),
  };
}

TEST_F(Operations, ArgumentsOfOtherTypesDoNoHarm) {
  for (const ClassData* each : served) {
    const ObjectPath path = someInstance(*each).path;
    for (const host::MethodData& method : host::methods(*each)) {
      for (std::size_t form = 0; form < careless(CMPI_null).size(); ++form) {
        host::NamedValues arguments = {{"NoSuchParameter", Value::boolean(true)}};
        for (const host::FeatureData& parameter : host::parameters(method))
          arguments.set(parameter.name, careless(parameter.cmpiType)[form]);
        const int answer = code(broker->invokeMethod(path, method.name, arguments), method.name);
        EXPECT_TRUE(answer == CMPI_RC_OK || answer == CMPI_RC_ERR_NOT_SUPPORTED ||
                    answer == CMPI_RC_ERR_FAILED)
            << each->name << "." << method.name << " " << answer;
      }
    }
  }
}

TEST_F(Operations, PropertiesOfOtherTypesDoNoHarm) {
  for (const std::string& name : WRITABLE) {
    const ClassData& each = *classes->find(name);
    const Instance some = someInstance(each);
    for (std::size_t form = 0; form < careless(CMPI_null).size(); ++form) {
      Instance sent = some;
      sent.properties.set("NoSuchProperty", Value::boolean(true));
      for (const host::FeatureData& feature : host::features(each))
        if (!feature.isKey) sent.properties.set(feature.name, careless(feature.cmpiType)[form]);
      clean(broker->modifyInstance(sent), name);
      clean(broker->createInstance(sent), name);
      Instance keyless = sent;
      keyless.path.keys = {};
      clean(broker->modifyInstance(keyless), name);
      clean(broker->createInstance(keyless), name);
      EXPECT_NE(code(broker->deleteInstance(keyless.path), name), CMPI_RC_OK) << name;
    }
  }
}

}  // namespace
}  // namespace tvx::test
