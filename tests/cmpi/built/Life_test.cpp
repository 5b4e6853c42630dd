// The life of a class in the built library: factories, tables, clean-ups, indications, and calls of
// the server from inside a request.
#include <dlfcn.h>

#include "Built_Fixture.h"
#include "Library_Blocks.h"

namespace cimrt::test {
namespace {

using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::EndsWith;
using ::testing::IsEmpty;

class Built_Life : public Built_Bridge {
 protected:
  template <class MI>
  MI* make(char letter, const char* class_name = "TEST_Part") {
    return static_cast<MI*>(
        control->interface(class_name, broker.face(), straight.context, letter));
  }
  template <class MI>
  CMPIrc cleanup(MI* mi, bool terminating = false) {
    return mi->ft->cleanup(mi, straight.context, terminating ? 1 : 0).rc;
  }

  Straight_Call straight{broker};
};

TEST_F(Built_Life, OnlyFactoriesAndTheModuleAreSeenFromOutside) {
  void* library = dlopen(CMPI_TEST_MODULE, RTLD_NOW | RTLD_NOLOAD);
  ASSERT_NE(library, nullptr);
  for (const char* name :
       {"cimrt_module", "cmpi_test_control", "TEST_Part_Create_MethodMI",
        "TEST_Part_Provider_Create_InstanceMI", "TEST_Link_Provider_Create_AssociationMI"})
    EXPECT_NE(dlsym(library, name), nullptr) << name;
  for (const char* name : {"_ZN5cimrt7destroyEPNS_8InstanceE", "_ZN5cimrt21_log_enabled_stateE",
                           "TEST_Part_Provider_Create_IndicationMI"})
    EXPECT_EQ(dlsym(library, name), nullptr) << name;
  dlclose(library);
}

TEST_F(Built_Life, AClassGivesAllItsMemoryBack) {
  cleanup(make<CMPIInstanceMI>('I'));  // makes the class descriptions as well, which stay
  control->reset();
  const std::size_t before = Library_Blocks::live();
  auto* instance = make<CMPIInstanceMI>('I');
  EXPECT_GT(Library_Blocks::live(), before) << "the adapter and its provider are not seen";
  EXPECT_EQ(cleanup(instance), CMPI_RC_OK);
  EXPECT_EQ(Library_Blocks::live(), before);
}

TEST_F(Built_Life, FactoriesLeaveTheStatusAlone) {
  void* library = dlopen(CMPI_TEST_MODULE, RTLD_NOW | RTLD_NOLOAD);
  ASSERT_NE(library, nullptr);
  using Factory = CMPIInstanceMI* (*)(const CMPIBroker*, const CMPIContext*, CMPIStatus*);
  for (const char* name : {"TEST_Part_Provider_Create_InstanceMI", "TEST_Part_Create_InstanceMI"}) {
    auto factory = reinterpret_cast<Factory>(dlsym(library, name));
    CMPIStatus status = {static_cast<CMPIrc>(77), nullptr};
    CMPIInstanceMI* made = factory(broker.face(), straight.context, &status);
    ASSERT_NE(made, nullptr);
    EXPECT_EQ(status.rc, 77);
    EXPECT_EQ(factory(broker.face(), straight.context, nullptr), made);
    EXPECT_EQ(cleanup(made), CMPI_RC_OK);
    EXPECT_EQ(cleanup(made), CMPI_RC_OK);
  }
  dlclose(library);
}

TEST_F(Built_Life, TheInstanceTableAloneHasANameAndItIsThatOfTheAssociations) {
  auto* instance = make<CMPIInstanceMI>('I');
  EXPECT_STREQ(instance->ft->miName, "associationTEST_Part_Provider");
  EXPECT_EQ(make<CMPIMethodMI>('M')->ft->miName, nullptr);
  EXPECT_EQ(make<CMPIAssociationMI>('A')->ft->miName, nullptr);
  EXPECT_EQ(make<CMPIIndicationMI>('N')->ft->miName, nullptr);
  for (int i = 0; i < 4; ++i) cleanup(instance);
}

TEST_F(Built_Life, AnUnknownLetterGivesNothingButCounts) {
  EXPECT_EQ(make<void>('X'), nullptr);
  auto* instance = make<CMPIInstanceMI>('I');
  EXPECT_EQ(cleanup(instance), CMPI_RC_OK);
  EXPECT_EQ(control->count("TEST_Part", OPERATION_UNLOAD), 0U);
  EXPECT_EQ(cleanup(instance), CMPI_RC_OK);
  EXPECT_EQ(control->count("TEST_Part", OPERATION_UNLOAD), 1U);
}

TEST_F(Built_Life, EachStepHasItsLine) {
  const Trace_Log log;
  auto* instance = make<CMPIInstanceMI>('I');
  auto* method = make<CMPIMethodMI>('M');
  EXPECT_EQ(cleanup(method), CMPI_RC_OK);
  EXPECT_EQ(cleanup(instance), CMPI_RC_OK);
  const std::vector<Log_Line> all = log.lines();
  std::vector<std::string> texts;
  for (const Log_Line& line : all) {
    EXPECT_EQ(line.level, "DBG");
    texts.push_back(line.text);
  }
  EXPECT_THAT(texts,
              ElementsAre("enter: CMPI_Adapter()", "return: CMPI_Adapter()",
                          "enter: cimrt_cmpi_adapter()", "return: cimrt_cmpi_adapter()",
                          "enter: cimrt_cmpi_adapter()", "return: cimrt_cmpi_adapter()",
                          "enter: cleanup()", "cleanup decrement", "enter: cleanup()",
                          "cleanup unload", "enter: ~CMPI_Adapter()", "return: ~CMPI_Adapter()"));
}

TEST_F(Built_Life, AFailedLoadIsNotSeenByTheServer) {
  play("TEST_Part", OPERATION_LOAD, "30");
  play("TEST_Part", OPERATION_UNLOAD, "30");
  const Reply reply = run(request(Call::EnumerateInstances, {"", NAME_SPACE, "TEST_Part", {}}));
  EXPECT_EQ(reply.status.rc, CMPI_RC_OK);
  EXPECT_TRUE(reply.instances.empty());
  EXPECT_TRUE(reply.done);
  EXPECT_EQ(broker.cleanup("TEST_Part", InterfaceKind::Instance, false).rc, CMPI_RC_OK);
  EXPECT_EQ(control->count("TEST_Part", OPERATION_UNLOAD), 1U);
}

TEST_F(Built_Life, AProviderMayRefuseToGoUntilTheServerEnds) {
  play("TEST_Part", OPERATION_ENUM_INSTANCES, "keep yes");
  run(request(Call::EnumerateInstances, {"", NAME_SPACE, "TEST_Part", {}}));
  const Trace_Log log;
  EXPECT_EQ(broker.cleanup("TEST_Part", InterfaceKind::Instance, false).rc, CMPI_RC_DO_NOT_UNLOAD);
  EXPECT_THAT(log.lines(), ElementsAre(Log_Line{"DBG", "enter: cleanup()"},
                                       Log_Line{"DBG", "cleanup do not unload"}));
  EXPECT_EQ(control->count("TEST_Part", OPERATION_UNLOAD), 0U);
  EXPECT_EQ(broker.cleanup("TEST_Part", InterfaceKind::Instance, true).rc, CMPI_RC_OK);
  EXPECT_EQ(control->count("TEST_Part", OPERATION_UNLOAD), 1U);

  run(request(Call::EnumerateInstances, {"", NAME_SPACE, "TEST_Part", {}}));
  play("TEST_Part", OPERATION_ENUM_INSTANCES, "keep no");
  run(request(Call::EnumerateInstances, {"", NAME_SPACE, "TEST_Part", {}}));
  EXPECT_EQ(broker.cleanup("TEST_Part", InterfaceKind::Instance, false).rc, CMPI_RC_OK);
}

// ---- Indications

TEST_F(Built_Life, StatusesOfIndicationsMap) {
  auto* mi = make<CMPIIndicationMI>('N');
  const struct {
    const char* enable;
    const char* disable;
    CMPIrc enabled;
    CMPIrc disabled;
  } rows[] = {{"140", "150", CMPI_RC_ERR_FAILED, CMPI_RC_ERR_FAILED},
              {"0", "0", CMPI_RC_OK, CMPI_RC_OK},
              {"-1", "-1", CMPI_RC_OK, CMPI_RC_OK},
              {"141", "151", CMPI_RC_OK, CMPI_RC_OK}};
  for (const auto& row : rows) {
    play("TEST_Part", OPERATION_ENABLE_INDICATIONS, row.enable);
    play("TEST_Part", OPERATION_DISABLE_INDICATIONS, row.disable);
    EXPECT_EQ(mi->ft->enableIndications(mi, straight.context).rc, row.enabled) << row.enable;
    EXPECT_EQ(mi->ft->enableIndications(mi, straight.context).rc, CMPI_RC_OK)
        << "they count as enabled, whatever the provider said";
    EXPECT_EQ(mi->ft->disableIndications(mi, straight.context).rc, row.disabled) << row.disable;
    EXPECT_EQ(mi->ft->disableIndications(mi, straight.context).rc, CMPI_RC_OK);
  }
  EXPECT_EQ(control->count("TEST_Part", OPERATION_ENABLE_INDICATIONS), std::size(rows));
  EXPECT_EQ(control->count("TEST_Part", OPERATION_DISABLE_INDICATIONS), std::size(rows));
  const Trace_Log log;
  EXPECT_EQ(cleanup(mi), CMPI_RC_OK);
  EXPECT_EQ(log.texts("DBG").at(0), "enter: indicationCleanup()");
  EXPECT_EQ(log.texts("DBG").at(1), "enter: cleanup()");
}

TEST_F(Built_Life, FiltersAreNeverRefusedAndCountedByNamespace) {
  auto* mi = make<CMPIIndicationMI>('N');
  const CMPIIndicationMIFT& table = *mi->ft;
  const auto filter = [&](auto call, const char* name_space) {
    return call(mi, straight.context, nullptr, "TEST_Part",
                straight.path({"", name_space, "TEST_Part", {}}), CMPIBoolean{1})
        .rc;
  };
  EXPECT_EQ(table.authorizeFilter(mi, straight.context, nullptr, "No_Such", nullptr, "nobody").rc,
            CMPI_RC_OK);
  EXPECT_EQ(table.mustPoll(mi, straight.context, nullptr, nullptr, "No_Such", nullptr).rc,
            CMPI_RC_OK);
  EXPECT_EQ(filter(table.deActivateFilter, "root/never"), CMPI_RC_OK);
  EXPECT_EQ(filter(table.activateFilter, "root/a"), CMPI_RC_OK);
  EXPECT_EQ(filter(table.activateFilter, "root/b"), CMPI_RC_OK);
  EXPECT_EQ(filter(table.activateFilter, "root/b"), CMPI_RC_OK);
  EXPECT_EQ(filter(table.deActivateFilter, "root/a"), CMPI_RC_OK);
  EXPECT_EQ(filter(table.deActivateFilter, "root/b"), CMPI_RC_OK);
  play("TEST_Part", OPERATION_ENABLE_INDICATIONS, "deliver TEST_Part(Id=event)");
  const Trace_Log log;
  EXPECT_EQ(table.enableIndications(mi, straight.context).rc, CMPI_RC_OK);
  const auto delivered = broker.indications();
  ASSERT_EQ(delivered.size(), 1U);
  EXPECT_EQ(delivered[0].nameSpace, "root/b");
  EXPECT_EQ(delivered[0].instance.text("Id"), "event");
  EXPECT_THAT(log.texts("WARN"),
              ElementsAre("No ObjectPath built before call to make_CMPI_instance"));
  EXPECT_STREQ(control->asked(), "wanted\n");
  EXPECT_EQ(cleanup(mi), CMPI_RC_OK);
}

// ---- Calls of the server

class Built_Up_Calls : public Built_Bridge {
 protected:
  Built_Up_Calls() {
    broker.addForeign(R"({"version": 1, "instances": [
      {"class": "TEST_Spare", "namespace": "root/test", "keys": ["Id"], "properties":
        {"Id": {"type": "string", "value": "one"}, "Caption": {"type": "string", "value": "c"}}}],
      "failures": [{"class": "TEST_Triple", "operation": "enumerateInstances", "rc": 1}]})");
  }
  /// The notes of a request whose provider follows `steps`.
  std::vector<std::string> notes(const std::string& steps) {
    play("TEST_Element", OPERATION_ENUM_INSTANCES, steps);
    const Reply reply =
        run(request(Call::EnumerateInstances, {"", NAME_SPACE, "TEST_Element", {}}));
    EXPECT_EQ(reply.status.rc, CMPI_RC_OK) << steps;
    if (!asked.empty()) asked.erase(asked.begin());
    return asked;
  }
};

TEST_F(Built_Up_Calls, ReadOtherClassesAndTheOwnOne) {
  EXPECT_THAT(notes("up get TEST_Spare(Id=one)"),
              ElementsAre("got TEST_Spare(Id=\"one\", Caption=\"c\")"));
  play("TEST_Element", OPERATION_GET_INSTANCE, "out TEST_Element(Id=self)");
  EXPECT_THAT(
      notes("up get TEST_Element(Id=self)"),
      ElementsAre("get TEST_Element(Id=\"self\", Caption=\"\")", "got TEST_Element(Id=\"self\")"));
  EXPECT_THAT(notes("up list TEST_Spare()"),
              ElementsAre("list 0", "item TEST_Spare(Id=\"one\", Caption=\"c\")"));
  EXPECT_THAT(texts("WARN"), IsEmpty());
}

TEST_F(Built_Up_Calls, ThatFailAnswerSoWithoutALine) {
  EXPECT_THAT(notes("up get TEST_Spare(Id=two); up list TEST_Triple()"),
              ElementsAre("got nothing", "list -1"));
  EXPECT_THAT(notes("up modify TEST_Part(Id=p); up delete TEST_Part(Id=p)"),
              ElementsAre("changed -1", "changed -1"));
  EXPECT_THAT(texts("WARN"), IsEmpty());
  EXPECT_THAT(texts("ERR"), IsEmpty());
}

TEST_F(Built_Up_Calls, OfMethodsTellTheirFailures) {
  play("TEST_All", OPERATION_INVOKE_METHOD, "set return_value=4; set Ouint32=5");
  EXPECT_THAT(notes("up invoke TEST_All(Id=x)"),
              Contains("invoked 0 Run(Ouint32=5, return_value=4)"));
  EXPECT_THAT(texts("WARN"), IsEmpty());
  play("TEST_All", OPERATION_INVOKE_METHOD, "132");
  EXPECT_THAT(notes("up invoke TEST_All(Id=x)"), Contains("invoked -1 Run()"));
  EXPECT_THAT(texts("WARN"), ElementsAre("failed[2]"));
  EXPECT_THAT(notes("up invoke"), ElementsAre("invoked -1 Run()"));
  EXPECT_THAT(texts("WARN"), ElementsAre("failed"));
  // A call that ran but has no value to return.
  play("TEST_All", OPERATION_INVOKE_METHOD, "0");
  EXPECT_THAT(notes("up invoke TEST_All(Id=x)"), Contains("invoked -1 Run()"));
  EXPECT_THAT(texts("WARN"), ElementsAre("unknown type", "failed"));
}

TEST_F(Built_Up_Calls, KnowTheUser) {
  EXPECT_THAT(notes("up user"), ElementsAre("user root"));
  EXPECT_THAT(texts("ERR"), IsEmpty());
}

TEST_F(Built_Up_Calls, WithoutAContextAreRefusedOneByOne) {
  // A provider is made before there is a context.
  play("TEST_Part", OPERATION_CREATE_PROVIDER,
       "up get TEST_Spare(Id=one); up list TEST_Spare(); up create TEST_Spare(Id=two); "
       "up modify TEST_Spare(Id=one); up delete TEST_Spare(Id=one); up invoke TEST_All(Id=x); "
       "up user; keep yes");
  const Trace_Log log;
  ASSERT_NE(broker.interface("TEST_Part", InterfaceKind::Instance), nullptr);
  EXPECT_STREQ(control->asked(),
               "got nothing\nlist -1\nchanged -1\nchanged -1\nchanged -1\n"
               "invoked -1 Run()\nno user\n");
  EXPECT_THAT(log.texts("WARN"), IsEmpty());
  EXPECT_THAT(log.texts("ERR"), IsEmpty());
  EXPECT_EQ(broker.cleanup("TEST_Part", InterfaceKind::Instance, false).rc, CMPI_RC_OK)
      << "nobody was there to be told that the library must stay";
}

TEST_F(Built_Up_Calls, MissAUserAtTheLevelOfAnError) {
  play("TEST_Element", OPERATION_ENUM_INSTANCES, "up user");
  auto* face =
      static_cast<CMPIInstanceMI*>(broker.interface("TEST_Element", InterfaceKind::Instance));
  Straight_Call straight(broker);  // its context has no entries
  const Trace_Log log;
  EXPECT_EQ(face->ft
                ->enumerateInstanceNames(face, straight.context, straight.result,
                                         straight.path({"", NAME_SPACE, "TEST_Element", {}}))
                .rc,
            CMPI_RC_OK);
  EXPECT_THAT(std::string(control->asked()), EndsWith("no user\n"));
  EXPECT_THAT(log.texts("ERR"), ElementsAre("username not OK cmpirc=12"));
}

}  // namespace
}  // namespace cimrt::test
