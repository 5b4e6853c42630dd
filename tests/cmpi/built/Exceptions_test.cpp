// Providers that throw, whatever and wherever: the server gets a failure, the class serves on, and
// nothing is lost.
#include <set>

#include "Built_Fixture.h"
#include "Library_Blocks.h"

namespace cimrt::test {
namespace {

using ::testing::Contains;
using ::testing::ElementsAre;

constexpr const char* kinds[] = {"runtime_error", "bad_alloc", "int", "text", "odd"};

class Exceptions : public Built_Bridge {
 protected:
  void expect_failure(const Request& wish, const char* name, const std::string& what) {
    const Reply reply = run(wish);
    EXPECT_EQ(reply.status.rc, CMPI_RC_ERR_FAILED) << what;
    EXPECT_FALSE(reply.done) << what;
    EXPECT_EQ(ending(), std::string(name) + "(): CMPI_RC_ERR_FAILED") << what;
    EXPECT_TRUE(texts("ERR").empty() && texts("FATAL").empty()) << what;
  }
  Request part_request(Call call) const {
    Request made = request(call, path("TEST_Part", "a"));
    made.instance = object("TEST_Part", {{"Id", Any::string("a")}});
    return made;
  }
};

TEST_F(Exceptions, EndInstanceOperationsAsFailures) {
  const struct {
    std::uint32_t operation;
    Call call;
    const char* name;
    const char* before;  ///< what the provider does first
  } rows[] = {
      {OPERATION_GET_INSTANCE, Call::GetInstance, "getInstance", ""},
      {OPERATION_GET_INSTANCE, Call::GetInstance, "getInstance", "out TEST_Part(Id=a); "},
      {OPERATION_ENUM_INSTANCES, Call::GetInstance, "getInstance", "deliver TEST_Part(Id=a); "},
      {OPERATION_ENUM_INSTANCES, Call::EnumerateInstanceNames, "enumInstanceNames",
       "deliver TEST_Part(Id=a); "},
      {OPERATION_ENUM_INSTANCES, Call::EnumerateInstances, "enumInstances",
       "deliver TEST_Part(Id=a, Caption=c); "},
      {OPERATION_CREATE_INSTANCE, Call::CreateInstance, "createInstance", "set Id=b; "},
      {OPERATION_MODIFY_INSTANCE, Call::ModifyInstance, "modifyInstance", ""},
      {OPERATION_DELETE_INSTANCE, Call::DeleteInstance, "deleteInstance", ""},
  };
  for (const auto& row : rows)
    for (const std::string kind : kinds) {
      control->reset();
      play("TEST_Part", row.operation, row.before + ("break " + kind));
      expect_failure(part_request(row.call), row.name, row.name + (" " + kind));
      // The class's lock is free again, and its next request is served.
      play("TEST_Part", OPERATION_ENUM_INSTANCES, "deliver TEST_Part(Id=a)");
      EXPECT_EQ(run(part_request(Call::EnumerateInstances)).instances.size(), 1U);
    }
}

TEST_F(Exceptions, EndMethodsAsFailures) {
  Request wish = request(Call::InvokeMethod, path("TEST_All", "x"));
  wish.method = "Run";
  wish.arguments = {{"Istring", Any::string("s")},
                    {"IParts", Any::array(CMPI_ref, {Any::reference(path("TEST_Part", "p"))})}};
  for (const std::string kind : kinds) {
    play("TEST_All", OPERATION_INVOKE_METHOD,
         "set Ostring=o; set OPart=TEST_Part(Id=q); break " + kind);
    expect_failure(wish, "invokeMethod", kind);
  }
}

TEST_F(Exceptions, OfMissingMemoryEndMethodsWithTheNameOfWhatCouldNotBeMade) {
  Request wish = request(Call::InvokeMethod, path("TEST_All", "x"));
  wish.method = "Run";
  wish.arguments = {{"IPart", Any::reference(path("TEST_Part", "p"))}};
  play("TEST_All", OPERATION_INVOKE_METHOD, "0");
  EXPECT_EQ(run(wish).status.rc, CMPI_RC_OK);
  std::set<std::string> endings;
  std::set<std::string> warnings;
  bool failed = true;
  for (long number = 0; failed; ++number) {
    const Trace_Log log;
    const std::size_t before = Library_Blocks::live();
    Library_Blocks::fail_after(number);
    const Reply reply = broker.run(wish);
    failed = Library_Blocks::stop();
    control->asked();
    // Once the results are told to be complete, a line of the log that is lost changes nothing.
    EXPECT_EQ(reply.status.rc, reply.done ? CMPI_RC_OK : CMPI_RC_ERR_FAILED) << number;
    EXPECT_TRUE(reply.done || failed) << number;
    EXPECT_FALSE(reply.report.leaks());
    EXPECT_LE(Library_Blocks::live(), before + 1) << number << ": more than the note was lost";
    endings.insert(log.texts("DBG").empty() ? "" : log.texts("DBG").back());
    for (const std::string& text : log.texts("WARN")) warnings.insert(text);
    ASSERT_LT(number, 1000);
  }
  EXPECT_THAT(endings, Contains("return: invokeMethod(): CMPI_RC_ERR_FAILED CIMRT reference "
                                "creation failed"));
  EXPECT_THAT(endings, Contains("return: invokeMethod(): CMPI_RC_ERR_FAILED CIMRT "
                                "make_cimrt_method function failed"));
  EXPECT_THAT(warnings, Contains("failed to create CIMRT instance"));
}

TEST_F(Exceptions, EndWalksAsFailures) {
  const std::string link =
      "deliver TEST_Link(Antecedent=TEST_Element(Id=e), Dependent=TEST_Part(Id=p)); break ";
  const struct {
    std::uint32_t operation;
    Call call;
    const char* name;
  } rows[] = {{OPERATION_ENUM_INSTANCES, Call::Associators, "associators"},
              {OPERATION_ENUM_INSTANCES, Call::AssociatorNames, "associatorNames"},
              {OPERATION_ENUM_INSTANCES, Call::References, "references"},
              {OPERATION_ENUM_INSTANCES, Call::ReferenceNames, "referenceNames"},
              {OPERATION_ENUM_ASSOCIATOR_NAMES, Call::AssociatorNames, "associatorNames"},
              {OPERATION_ENUM_ASSOCIATOR_NAMES, Call::Associators, "associators"},
              {OPERATION_ENUM_ASSOCIATORS, Call::Associators, "associators"},
              {OPERATION_ENUM_REFERENCES, Call::References, "references"},
              {OPERATION_ENUM_REFERENCES, Call::ReferenceNames, "referenceNames"}};
  for (const auto& row : rows)
    for (const std::string kind : kinds) {
      control->reset();
      play("TEST_Link", row.operation, link + kind);
      expect_failure(request(row.call, path("TEST_Element", "e")), row.name, kind);
    }
}

TEST_F(Exceptions, OfTheProviderBehindAnUpCallAreTheServersFailureAlone) {
  play("TEST_Part", OPERATION_GET_INSTANCE, "break odd");
  play("TEST_Link", OPERATION_ENUM_INSTANCES,
       "deliver TEST_Link(Antecedent=TEST_Element(Id=e), Dependent=TEST_Part(Id=p))");
  const Reply walk = run(request(Call::Associators, path("TEST_Element", "e")));
  EXPECT_EQ(walk.status.rc, CMPI_RC_OK);
  EXPECT_TRUE(walk.instances.empty());
  EXPECT_EQ(ending(), "associators(): CMPI_RC_OK");
  EXPECT_THAT(texts("DBG"), Contains("return: getInstance(): CMPI_RC_ERR_FAILED"));

  play("TEST_Element", OPERATION_ENUM_INSTANCES, "up get TEST_Part(Id=p)");
  const Reply inner = run(request(Call::EnumerateInstances, {"", NAME_SPACE, "TEST_Element", {}}));
  EXPECT_EQ(inner.status.rc, CMPI_RC_OK);
  EXPECT_THAT(asked, Contains("got nothing"));
}

TEST_F(Exceptions, OfTheLookUpsEndRequestsToo) {
  for (const char* kind : kinds) {
    control->break_behind("TEST_Part", OPERATION_GET_REPOSITORY, kind);
    expect_failure(part_request(Call::EnumerateInstances), "enumInstances", kind);
    expect_failure(part_request(Call::CreateInstance), "createInstance", kind);
    control->break_behind("TEST_Link", OPERATION_GET_META_CLASS, kind);
    expect_failure(request(Call::ReferenceNames, path("TEST_Element", "e")), "referenceNames",
                   kind);
    expect_failure(request(Call::AssociatorNames, path("TEST_Element", "e")), "associatorNames",
                   kind);
  }
}

TEST_F(Exceptions, OfLoadingAndUnloadingStayInside) {
  for (const std::string kind : kinds) {
    control->reset();
    play("TEST_Part", OPERATION_LOAD, "break " + kind);
    play("TEST_Part", OPERATION_UNLOAD, "break " + kind);
    control->break_behind("TEST_Part", OPERATION_DESTROY_PROVIDER, kind.c_str());
    const Trace_Log log;
    EXPECT_EQ(run(part_request(Call::EnumerateInstances)).status.rc, CMPI_RC_OK) << kind;
    EXPECT_EQ(broker.cleanup("TEST_Part", InterfaceKind::Instance, false).rc, CMPI_RC_OK) << kind;
    EXPECT_THAT(log.texts("DBG"), Contains("return: CMPI_Adapter()"));
    EXPECT_THAT(log.texts("DBG"), Contains("return: ~CMPI_Adapter()"));
    EXPECT_EQ(control->count("TEST_Part", OPERATION_LOAD), 1U);
    EXPECT_EQ(control->count("TEST_Part", OPERATION_DESTROY_PROVIDER), 1U);
  }
}

TEST_F(Exceptions, OfMakingAProviderLeaveTheServerWithoutAnInterface) {
  for (const std::string kind : kinds) {
    play("TEST_Part", OPERATION_CREATE_PROVIDER, "break " + kind);
    const std::size_t before = Library_Blocks::live();
    EXPECT_EQ(broker.interface("TEST_Part", InterfaceKind::Instance), nullptr) << kind;
    EXPECT_EQ(broker.enumerateInstances("TEST_Part").status.rc, CMPI_RC_ERR_NOT_SUPPORTED) << kind;
    EXPECT_LE(Library_Blocks::live(), before + 1) << "the list of calls may grow";
  }
  play("TEST_Part", OPERATION_CREATE_PROVIDER, "0");
  EXPECT_EQ(broker.enumerateInstances("TEST_Part").status.rc, CMPI_RC_OK);
}

TEST_F(Exceptions, OfIndicationsAreFailures) {
  Straight_Call straight(broker);
  auto* mi = static_cast<CMPIIndicationMI*>(
      control->interface("TEST_Part", broker.face(), straight.context, 'N'));
  for (const std::string kind : kinds) {
    play("TEST_Part", OPERATION_ENABLE_INDICATIONS, "break " + kind);
    control->break_behind("TEST_Part", OPERATION_DISABLE_INDICATIONS, kind.c_str());
    const Trace_Log log;
    EXPECT_EQ(mi->ft->enableIndications(mi, straight.context).rc, CMPI_RC_ERR_FAILED) << kind;
    EXPECT_EQ(mi->ft->disableIndications(mi, straight.context).rc, CMPI_RC_ERR_FAILED) << kind;
    EXPECT_THAT(log.texts("DBG"), ElementsAre("enter: enableIndications()",
                                              "return: enableIndications(): CMPI_RC_ERR_FAILED",
                                              "enter: disableIndications()",
                                              "return: disableIndications(): CMPI_RC_ERR_FAILED"));
    control->break_behind("TEST_Part", OPERATION_DISABLE_INDICATIONS, nullptr);
    mi->ft->disableIndications(mi, straight.context);
  }
  EXPECT_EQ(mi->ft->cleanup(mi, straight.context, 1).rc, CMPI_RC_OK);
}

}  // namespace
}  // namespace cimrt::test
