// Objects of a server that are not what they should be, and a server that refuses what the bridge
// makes of an instance: one value is lost and told in the log, the operation succeeds.
#include <list>

#include "Failing_Server.h"

namespace cimrt::test {
namespace {

using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using Texts = std::vector<std::string>;

// ---- On the way in

/// An instance that answers prepared data, as no well-behaved server has them.
class Prepared_Instance {
 public:
  struct Property {
    CMPIString* name;
    CMPIData data;
    CMPIrc code = CMPI_RC_OK;
  };

  Prepared_Instance() {
    _table.getPropertyCount = [](const CMPIInstance* self, CMPIStatus*) {
      return static_cast<CMPICount>(of(self).properties.size());
    };
    _table.getPropertyAt = [](const CMPIInstance* self, CMPICount index, CMPIString** name,
                              CMPIStatus* status) {
      const Property& property = of(self).properties.at(index);
      if (name) *name = property.name;
      if (status) *status = {property.code, nullptr};
      return property.data;
    };
  }
  static const Prepared_Instance& of(const CMPIInstance* self) {
    return *static_cast<const Prepared_Instance*>(self->hdl);
  }
  const CMPIInstance* face() { return &_face; }

  std::vector<Property> properties;

 private:
  CMPIInstanceFT _table{};
  CMPIInstance _face{this, &_table};
};

/// An array that answers prepared data.
class Prepared_Array {
 public:
  explicit Prepared_Array(std::vector<CMPIData> elements) : _elements(std::move(elements)) {
    _table.getSize = [](const CMPIArray* self, CMPIStatus*) {
      return static_cast<CMPICount>(of(self)._elements.size());
    };
    _table.getElementAt = [](const CMPIArray* self, CMPICount index, CMPIStatus* status) {
      if (status) *status = {CMPI_RC_OK, nullptr};
      return of(self)._elements.at(index);
    };
  }
  CMPIArray* face() { return &_face; }

 private:
  static const Prepared_Array& of(const CMPIArray* self) {
    return *static_cast<const Prepared_Array*>(self->hdl);
  }

  std::vector<CMPIData> _elements;
  CMPIArrayFT _table{};
  CMPIArray _face{this, &_table};
};

class Broken_Objects : public Failing_Server {
 protected:
  Broken_Objects() { play("TEST_All", OPERATION_CREATE_INSTANCE, "0"); }

  static CMPIData data(CMPIType type, CMPIValueState state = CMPI_goodValue) {
    CMPIData made = {};
    made.type = type;
    made.state = state;
    return made;
  }
  CMPIString* text(std::optional<std::string> chars) {
    return tvx::host::makeString(straight.core, std::move(chars), tvx::host::Origin::HandedOut);
  }
  CMPIData texts_of(std::vector<CMPIString*> elements) {
    std::vector<CMPIData> list;
    for (CMPIString* each : elements) {
      list.push_back(data(CMPI_string));
      list.back().value.string = each;
    }
    return array(CMPI_string, std::move(list));
  }
  CMPIData array(CMPIType element_type, std::vector<CMPIData> elements) {
    CMPIData made = data(static_cast<CMPIType>(element_type | CMPI_ARRAY));
    made.value.array = _arrays.emplace_back(std::move(elements)).face();
    return made;
  }
  /// What a provider gets of an instance with one property; the lines are in `warnings`.
  std::string created(const char* name, const CMPIData& value) {
    return created({{text(name), value}});
  }
  std::string created(std::vector<Prepared_Instance::Property> properties) {
    auto* face =
        static_cast<CMPIInstanceMI*>(broker.interface("TEST_All", InterfaceKind::Instance));
    Prepared_Instance sent;
    sent.properties = std::move(properties);
    const Trace_Log log;
    const CMPIStatus status = face->ft->createInstance(
        face, straight.context, straight.result, straight.path(path("TEST_All", "x")), sent.face());
    EXPECT_EQ(status.rc, CMPI_RC_OK);
    EXPECT_EQ(status.msg, nullptr);
    warnings = log.texts("WARN");
    EXPECT_EQ(log.lines().size(), warnings.size() + 2);
    EXPECT_FALSE(straight.scope.report().leaks());
    std::string asked_for = control->asked();
    EXPECT_TRUE(asked_for.starts_with("create TEST_All("));
    return asked_for.substr(16, asked_for.size() - 18);
  }

  Texts warnings;

 private:
  std::list<Prepared_Array> _arrays;
};

TEST_F(Broken_Objects, TextsThatAreMissingAreEmptyWhileTimesAreLeftOut) {
  EXPECT_EQ(created("Vstring", data(CMPI_string)), "Vstring=\"\"");
  EXPECT_THAT(warnings, ElementsAre("ignored null CMPI string"));
  EXPECT_EQ(created("Astring", texts_of({text("a"), nullptr, text({})})),
            "Astring={\"a\", \"\", \"\"}");
  EXPECT_THAT(warnings, ElementsAre("ignored null CMPI string", "CMGetCharsPtr() failed"));
  EXPECT_EQ(created("Vdatetime", data(CMPI_dateTime)), "");
  EXPECT_THAT(warnings,
              ElementsAre("CMGetStringFormat() failed", "unexpected failure: TEST_All.Vdatetime"));
  CMPIData time = data(CMPI_dateTime);
  time.value.dateTime =
      tvx::host::makeDateTime(straight.core, "tomorrow", tvx::host::Origin::HandedOut);
  EXPECT_EQ(created("Vdatetime", time), "");
  EXPECT_THAT(warnings, ElementsAre("conversion error", "unexpected failure: TEST_All.Vdatetime"));
  EXPECT_EQ(created("Adatetime", array(CMPI_dateTime, {time})), "");
  EXPECT_THAT(warnings, ElementsAre("conversion error", "unexpected failure: TEST_All.Adatetime"));
}

TEST_F(Broken_Objects, ArraysThatAreMissingOrMixedAreLeftOut) {
  EXPECT_EQ(created("Auint16", data(CMPI_uint16A)), "");
  EXPECT_THAT(warnings, ElementsAre("unexpected failure: TEST_All.Auint16"));
  EXPECT_EQ(created("Auint16", array(CMPI_uint16, {data(CMPI_uint16), data(CMPI_uint32)})), "");
  EXPECT_THAT(warnings, ElementsAre("type mismatch", "unexpected failure: TEST_All.Auint16"));
  EXPECT_EQ(created("Auint16", array(CMPI_uint16, {data(CMPI_uint16, CMPI_nullValue)})), "");
  EXPECT_THAT(warnings, ElementsAre("encountered null array element",
                                    "unexpected failure: TEST_All.Auint16"));
}

TEST_F(Broken_Objects, ListsOfInstancesHaveTheirOwnRules) {
  CMPIData part = data(CMPI_ref);
  part.value.ref = straight.path(path("TEST_Part", "p"));
  const Texts left = {"unexpected failure: TEST_All.AReference"};
  EXPECT_EQ(created("AReference", array(CMPI_ref, {part, data(CMPI_ref, CMPI_nullValue), part})),
            "AReference={TEST_Part(Id=\"p\"), null, TEST_Part(Id=\"p\")}");
  EXPECT_THAT(warnings, IsEmpty());
  EXPECT_EQ(created("AReference", array(CMPI_ref, {part, data(CMPI_ref)})), "");
  EXPECT_THAT(warnings, ElementsAre("encountered null instance element", left[0]));
  EXPECT_EQ(created("AReference", array(CMPI_ref, {part, data(CMPI_instance)})), "");
  EXPECT_THAT(warnings, ElementsAre("array element type mismatch", left[0]));
}

TEST_F(Broken_Objects, ANullReferenceIsToldAndANullEmbeddedInstanceIsNot) {
  EXPECT_EQ(created("VReference", data(CMPI_ref)), "");
  EXPECT_THAT(warnings, ElementsAre("null instance"));
  EXPECT_EQ(created("VEmbedded", data(CMPI_instance)), "");
  EXPECT_THAT(warnings, IsEmpty());
}

TEST_F(Broken_Objects, NestedInstancesThatDoNotTellTheirClassAreLeftOut) {
  CMPIInstanceFT pathless = {};
  pathless.getObjectPath = [](const CMPIInstance*, CMPIStatus* rc) -> CMPIObjectPath* {
    if (rc) rc->rc = CMPI_RC_ERR_FAILED;
    return nullptr;
  };
  CMPIInstance instance = {nullptr, &pathless};
  CMPIData embedded = data(CMPI_instance);
  embedded.value.inst = &instance;
  EXPECT_EQ(created("VEmbedded", embedded), "");
  EXPECT_THAT(warnings,
              ElementsAre("CMGetObjectPath() failed", "unexpected failure: TEST_All.VEmbedded"));
  CMPIObjectPathFT classless = {};
  classless.getClassName = [](const CMPIObjectPath*, CMPIStatus* rc) -> CMPIString* {
    if (rc) rc->rc = CMPI_RC_ERR_FAILED;
    return nullptr;
  };
  CMPIObjectPath target = {nullptr, &classless};
  CMPIData reference = data(CMPI_ref);
  reference.value.ref = &target;
  EXPECT_EQ(created("VReference", reference), "");
  EXPECT_THAT(warnings,
              ElementsAre("CMGetClassName() failed", "unexpected failure: TEST_All.VReference"));
}

TEST_F(Broken_Objects, PropertiesThatCannotBeReadAreLeftOut) {
  EXPECT_EQ(created("Vuint8", data(CMPI_args)), "");
  EXPECT_THAT(warnings, ElementsAre("unknown type", "unexpected failure: TEST_All.Vuint8"));
  EXPECT_EQ(created("Vuint8", data(CMPI_uint8, CMPI_notFound)), "");
  EXPECT_THAT(warnings, ElementsAre("unexpected failure: TEST_All.Vuint8"));
  EXPECT_EQ(created({{text("Vuint8"), data(CMPI_uint8), CMPI_RC_ERR_FAILED},
                     {text({}), data(CMPI_uint8)},
                     {nullptr, data(CMPI_uint8)},
                     {text("Vuint8"), data(CMPI_uint8)}}),
            "Vuint8=0");
  EXPECT_THAT(warnings,
              ElementsAre("CMGetPropertyAt() failed", "get_name() failed: class=TEST_All, index=0",
                          "get_name() failed: class=TEST_All, index=1",
                          "get_name() failed: class=TEST_All, index=2"));
}

TEST_F(Broken_Objects, AnyByteThatIsNotZeroIsTrue) {
  CMPIData truth = data(CMPI_boolean);
  truth.value.boolean = 7;
  EXPECT_EQ(created("Vboolean", truth), "Vboolean=true");
  EXPECT_THAT(warnings, IsEmpty());
}

// ---- On the way out

class Refusing_Server : public Failing_Server {
 protected:
  /// What the server gets of an object that a provider answers.
  Object got(const std::string& object, const char* name_space = NAME_SPACE) {
    play("TEST_All", OPERATION_GET_INSTANCE, "out " + object);
    auto* face =
        static_cast<CMPIInstanceMI*>(broker.interface("TEST_All", InterfaceKind::Instance));
    Straight_Call call(broker);
    ObjectPath wanted = path("TEST_All", "x");
    wanted.nameSpace = name_space;
    const CMPIObjectPath* target = call.path(wanted);
    if (!_function.empty()) faulty.fail(_function, _from);
    const Trace_Log log;
    const CMPIStatus status =
        face->ft->getInstance(face, call.context, call.result, target, nullptr);
    faulty.heal();
    warnings = log.texts("WARN");
    EXPECT_EQ(status.rc, CMPI_RC_OK);
    EXPECT_TRUE(call.reply.done);
    EXPECT_EQ(call.reply.instances.size(), 1U);
    return call.reply.instances.empty() ? Object() : call.reply.instances[0];
  }
  /// Lets a maker fail from that call on.
  void refuse(const std::string& function, int from) {
    _function = function;
    _from = from;
  }
  static Texts lost(const std::string& name) {
    return {"_to_cmpi_data() failed: feature=" + name, "conversion error: TEST_All." + name};
  }
  static Texts lost(const std::string& name, const char* reason) {
    Texts all = lost(name);
    all.insert(all.begin(), reason);
    return all;
  }

  Texts warnings;

 private:
  std::string _function;
  int _from = 1;
};

TEST_F(Refusing_Server, ValuesThatTheServerDoesNotMakeAreToldAndLost) {
  put_before("TEST_All");
  const struct {
    const char* function;
    int from;
    const char* object;
    const char* name;
    const char* reason;
  } rows[] = {
      {"newString", 1, "TEST_All(Vuint8=3, Vstring=s)", "Vstring", nullptr},
      {"newDateTimeFromChars", 1, "TEST_All(Vuint8=3, Vdatetime=20240229235959.123456+060)",
       "Vdatetime", nullptr},
      {"newArray", 1, "TEST_All(Vuint8=3, Astring={a})", "Astring", nullptr},
      {"newString", 2, "TEST_All(Vuint8=3, Astring={a, b})", "Astring",
       "CMSetArrayElementAt() failed"},
      {"newObjectPath", 1, "TEST_All(Vuint8=3, VReference=TEST_Part(Id=p))", "VReference",
       "CMNewObjectPath() failed"},
      {"newInstance", 2, "TEST_All(Vuint8=3, VEmbedded=TEST_Part(Id=p))", "VEmbedded",
       "CMNewInstance() failed"},
  };
  for (const auto& row : rows) {
    refuse(row.function, row.from);
    const Object made = got(row.object);
    EXPECT_EQ(made.property("Vuint8").asUnsigned(), 3U) << row.object;
    EXPECT_FALSE(made.has(row.name)) << row.object;
    EXPECT_EQ(warnings, row.reason ? lost(row.name, row.reason) : lost(row.name)) << row.object;
  }
}

TEST_F(Refusing_Server, NestedInstancesWithoutAPlaceOrAnElementAreToldAndLost) {
  EXPECT_FALSE(got("TEST_All(VReference=TEST_Part(Id=p))", "").has("VReference"));
  EXPECT_EQ(warnings, lost("VReference", "null namespace"));
  EXPECT_TRUE(got("TEST_All(VReference=root/own:TEST_Part(Id=p))", "").has("VReference"));
  EXPECT_THAT(warnings, IsEmpty());
  EXPECT_FALSE(got("TEST_All(AReference={TEST_Part(Id=p), null})").has("AReference"));
  Texts all = lost("AReference", "element conversion failed");
  all.insert(all.begin(), "null instance argument");
  EXPECT_EQ(warnings, all);
}

/// The broker's own maker, whose objects get another function table.
template <class T, class Table, class Change>
T* changed(T* made, Change&& change) {
  static Table table;
  table = *made->ft;
  change(table);
  made->ft = &table;
  return made;
}

TEST_F(Refusing_Server, AnswersThatTheServerRefusesAreToldAndLost) {
  static const CMPIBroker* real;
  real = broker.face();
  CMPIBrokerEncFT makers = *faulty.face()->eft;
  makers.newInstance = [](const CMPIBroker*, const CMPIObjectPath* path, CMPIStatus* rc) {
    return changed<CMPIInstance, CMPIInstanceFT>(
        real->eft->newInstance(real, path, rc), [](CMPIInstanceFT& table) {
          table.setProperty = [](const CMPIInstance*, const char*, const CMPIValue*, CMPIType) {
            return CMPIStatus{CMPI_RC_ERR_NO_SUCH_PROPERTY, nullptr};
          };
        });
  };
  makers.newObjectPath = [](const CMPIBroker*, const char* name_space, const char* name,
                            CMPIStatus* rc) {
    return changed<CMPIObjectPath, CMPIObjectPathFT>(
        real->eft->newObjectPath(real, name_space, name, rc), [](CMPIObjectPathFT& table) {
          table.addKey = [](CMPIObjectPath*, const char*, const CMPIValue*, CMPIType) {
            return CMPIStatus{CMPI_RC_ERR_FAILED, nullptr};
          };
        });
  };
  makers.newArray = [](const CMPIBroker*, CMPICount count, CMPIType type, CMPIStatus* rc) {
    return changed<CMPIArray, CMPIArrayFT>(
        real->eft->newArray(real, count, type, rc), [](CMPIArrayFT& table) {
          table.setElementAt = [](CMPIArray*, CMPICount, const CMPIValue*, CMPIType) {
            return CMPIStatus{CMPI_RC_ERR_TYPE_MISMATCH, nullptr};
          };
        });
  };
  CMPIBroker server = *faulty.face();
  server.eft = &makers;
  put_before<CMPIInstanceMI>("TEST_All", 'I', &server);

  EXPECT_TRUE(got("TEST_All(Vuint8=3)").properties.empty());
  EXPECT_THAT(warnings,
              ElementsAre("CMSetProperty() failed: Vuint8", "conversion error: TEST_All.Vuint8"));
  got("TEST_All(Astring={a})");
  EXPECT_EQ(warnings, lost("Astring", "CMSetArrayElementAt() failed"));

  play("TEST_All", OPERATION_ENUM_INSTANCES, "deliver TEST_All(Id=x)");
  const Trace_Log log;
  const Reply names =
      broker.run(request(Call::EnumerateInstanceNames, {"", NAME_SPACE, "TEST_All", {}}));
  EXPECT_EQ(names.status.rc, CMPI_RC_OK);
  ASSERT_EQ(names.paths.size(), 1U);
  EXPECT_TRUE(names.paths[0].keys.empty());
  EXPECT_THAT(log.texts("WARN"), ElementsAre("CMAddKey() failed", "conversion error: TEST_All.Id"));
}

TEST_F(Refusing_Server, OutputsThatTheServerRefusesAreToldAndLost) {
  play("TEST_All", OPERATION_INVOKE_METHOD, "set return_value=7; set Ostring=o");
  auto* face = static_cast<CMPIMethodMI*>(broker.interface("TEST_All", InterfaceKind::Method));
  CMPIArgs* in = tvx::host::makeArgs(straight.core, {}, tvx::host::Origin::HandedOut);
  CMPIArgs* out = changed<CMPIArgs, CMPIArgsFT>(
      tvx::host::makeArgs(straight.core, {}, tvx::host::Origin::HandedOut), [](CMPIArgsFT& table) {
        table.addArg = [](CMPIArgs*, const char*, const CMPIValue*, CMPIType) {
          return CMPIStatus{CMPI_RC_ERR_FAILED, nullptr};
        };
      });
  const Trace_Log log;
  EXPECT_EQ(face->ft
                ->invokeMethod(face, straight.context, straight.result,
                               straight.path(path("TEST_All", "x")), "Run", in, out)
                .rc,
            CMPI_RC_OK);
  EXPECT_THAT(log.texts("WARN"), ElementsAre("CMAddArg() failed", "conversion error: Run.Ostring"));
  ASSERT_EQ(straight.reply.data.size(), 1U);
  EXPECT_EQ(straight.reply.data[0], Any::number(CMPI_uint32, 7));
}

}  // namespace
}  // namespace cimrt::test
