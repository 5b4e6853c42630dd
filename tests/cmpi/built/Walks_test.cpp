// Associations through the built library, and where the four operations differ: in what they log,
// in what they answer, and in what of a result's failure they let through.
#include "Failing_Server.h"

namespace cimrt::test {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;

constexpr const char* LINK_1 =
    "deliver TEST_Link(Antecedent=TEST_Element(Id=e), Dependent=TEST_Part(Id=p1), Note=n)";
constexpr const char* LINK_2 =
    "deliver TEST_Link(Antecedent=TEST_Element(Id=e), Dependent=TEST_Part(Id=p2), Note=n)";

const std::pair<Call, const char*> calls[] = {{Call::Associators, "associators"},
                                              {Call::AssociatorNames, "associatorNames"},
                                              {Call::References, "references"},
                                              {Call::ReferenceNames, "referenceNames"}};

class Built_Walks : public Failing_Server {
 protected:
  Built_Walks() {
    play("TEST_Link", OPERATION_ENUM_INSTANCES, std::string(LINK_1) + "; " + LINK_2);
    play("TEST_Part", OPERATION_GET_INSTANCE, "out TEST_Part(Id=any, Caption=served)");
    play("TEST_Element", OPERATION_GET_INSTANCE, "out TEST_Element(Id=any)");
  }
  static std::size_t size(const Reply& reply) {
    return reply.paths.size() + reply.instances.size();
  }
  Reply walk(Call call, const ObjectPath& from, const char* association = "TEST_Link") {
    return run(request(call, from, association));
  }

  const ObjectPath source = path("TEST_Element", "e");
};

TEST_F(Built_Walks, AnUnknownSourceClassIsAnEmptySuccessThatThreeOfFourLogAsAnError) {
  for (const auto& [call, name] : calls) {
    const Reply reply = walk(call, path("TEST_Unknown", "e"));
    EXPECT_EQ(reply.status.rc, CMPI_RC_OK) << name;
    EXPECT_EQ(size(reply), 0U) << name;
    const std::string start = std::string(name) + "()";
    EXPECT_THAT(lines, ElementsAre(Log_Line{"DBG", "enter: " + start},
                                   Log_Line{"DBG", "return: " + start +
                                                       (call == Call::Associators
                                                            ? ": CMPI_RC_OK"
                                                            : ": CMPI_RC_ERR_INVALID_CLASS")}));
    EXPECT_THAT(asked, IsEmpty()) << name;
  }
}

TEST_F(Built_Walks, InstanceOperationsFailWithAnUnknownClassAndLogItSo) {
  const std::pair<Call, const char*> rows[] = {{Call::EnumerateInstanceNames, "enumInstanceNames"},
                                               {Call::EnumerateInstances, "enumInstances"},
                                               {Call::GetInstance, "getInstance"},
                                               {Call::DeleteInstance, "deleteInstance"},
                                               {Call::CreateInstance, "createInstance"},
                                               {Call::ModifyInstance, "modifyInstance"}};
  auto* face = static_cast<CMPIInstanceMI*>(broker.interface("TEST_Part", InterfaceKind::Instance));
  const CMPIInstanceMIFT& table = *face->ft;
  for (const auto& [call, name] : rows) {
    const Trace_Log log;
    Straight_Call direct(broker);
    const CMPIObjectPath* unknown = direct.path(path("TEST_Unknown", "a"));
    const CMPIInstance* sent = tvx::host::makeInstance(direct.core, {path("TEST_Unknown", "a"), {}},
                                                       tvx::host::Origin::HandedOut);
    const auto ask = [&]() -> CMPIStatus {
      CMPIContext* context = direct.context;
      CMPIResult* result = direct.result;
      switch (call) {
        case Call::EnumerateInstanceNames:
          return table.enumerateInstanceNames(face, context, result, unknown);
        case Call::EnumerateInstances:
          return table.enumerateInstances(face, context, result, unknown, nullptr);
        case Call::GetInstance:
          return table.getInstance(face, context, result, unknown, nullptr);
        case Call::DeleteInstance:
          return table.deleteInstance(face, context, result, unknown);
        case Call::CreateInstance:
          return table.createInstance(face, context, result, unknown, sent);
        default:
          return table.modifyInstance(face, context, result, unknown, sent, nullptr);
      }
    };
    const CMPIStatus status = ask();
    EXPECT_EQ(status.rc, CMPI_RC_ERR_FAILED) << name;
    EXPECT_EQ(status.msg, nullptr) << name;
    EXPECT_FALSE(direct.reply.done) << name;
    const std::string start = std::string(name) + "()";
    EXPECT_THAT(log.lines(),
                ElementsAre(Log_Line{"DBG", "enter: " + start},
                            Log_Line{"DBG", "return: " + start + ": CMPI_RC_ERR_FAILED"}));
  }
}

TEST_F(Built_Walks, AMethodOfAnUnknownClassSaysWhatWasNotFound) {
  auto* face = static_cast<CMPIMethodMI*>(broker.interface("TEST_All", InterfaceKind::Method));
  const Trace_Log log;
  Straight_Call direct(broker);
  CMPIArgs* none = tvx::host::makeArgs(direct.core, {}, tvx::host::Origin::HandedOut);
  const CMPIStatus status =
      face->ft->invokeMethod(face, direct.context, direct.result,
                             direct.path(path("TEST_Unknown", "a")), "Run", none, none);
  EXPECT_EQ(status.rc, CMPI_RC_ERR_FAILED);
  EXPECT_EQ(status.msg, nullptr);
  EXPECT_TRUE(log.has("DBG", "return: invokeMethod(): CMPI_RC_ERR_FAILED MetaClass not found"));
}

TEST_F(Built_Walks, AnotherClassOfTheSchemaIsAcceptedByEveryInterface) {
  play("TEST_Part", OPERATION_ENUM_INSTANCES, "echo");
  auto* face = static_cast<CMPIInstanceMI*>(broker.interface("TEST_Part", InterfaceKind::Instance));
  Straight_Call direct(broker);
  const CMPIStatus status = face->ft->enumerateInstanceNames(
      face, direct.context, direct.result, direct.path({"", NAME_SPACE, "test_SPARE", {}}));
  EXPECT_EQ(status.rc, CMPI_RC_OK);
  EXPECT_STREQ(control->asked(), "enumerate TEST_Spare()\nwanted\n");
  ASSERT_EQ(direct.reply.paths.size(), 1U);
  EXPECT_EQ(direct.reply.paths[0].className, "TEST_Spare");
}

TEST_F(Built_Walks, AClassThatIsNoAssociationFailsWithoutAnEnumeration) {
  for (const auto& [call, name] : calls) {
    const Reply reply = walk(call, source, "TEST_Element");
    EXPECT_EQ(reply.status.rc, CMPI_RC_ERR_FAILED) << name;
    EXPECT_EQ(ending(), std::string(name) + "(): CMPI_RC_ERR_FAILED");
  }
  for (const auto operation :
       {OPERATION_ENUM_INSTANCES, OPERATION_ENUM_REFERENCES, OPERATION_ENUM_ASSOCIATOR_NAMES})
    EXPECT_EQ(control->count("TEST_Element", operation), 0U);
  EXPECT_GT(control->count("TEST_Element", OPERATION_ENUM_ASSOCIATORS), 0U);
}

TEST_F(Built_Walks, NoneOfThemTellsTheEndOfTheResults) {
  for (const auto& [call, name] : calls) {
    const Reply reply = walk(call, source);
    EXPECT_EQ(reply.status.rc, CMPI_RC_OK) << name;
    EXPECT_EQ(size(reply), 2U) << name;
    EXPECT_FALSE(reply.done) << name;
    EXPECT_THAT(texts("WARN"), IsEmpty()) << name;
  }
}

TEST_F(Built_Walks, AskTheProviderForItsOwnAnswerFirst) {
  play("TEST_Link", OPERATION_ENUM_ASSOCIATOR_NAMES, "111");
  play("TEST_Link", OPERATION_ENUM_REFERENCES, "121");
  play("TEST_Link", OPERATION_ENUM_ASSOCIATORS, "171");
  Request wish = request(Call::Associators, source);
  wish.resultClass = "TEST_Part";
  wish.role = "Antecedent";
  wish.resultRole = "Dependent";
  run(wish);
  EXPECT_EQ(asked.at(0), "associators TEST_Element(Id=\"e\") TEST_Part/Antecedent/Dependent");
  EXPECT_EQ(asked.at(1), "names TEST_Element(Id=\"e\") TEST_Part/Antecedent/Dependent");
  EXPECT_EQ(asked.at(2), "enumerate TEST_Link()");
  wish.operation = Call::References;
  wish.resultClass = "TEST_Link";
  run(wish);
  // The model of `references` wants the properties; the names need the keys alone.
  EXPECT_EQ(asked.at(0), "references TEST_Element(Id=\"e\") TEST_Link(Note=\"\") Antecedent");
  EXPECT_EQ(asked.at(1), "enumerate TEST_Link(Note=\"\")");
  wish.operation = Call::ReferenceNames;
  run(wish);
  EXPECT_EQ(asked.at(0), "references TEST_Element(Id=\"e\") TEST_Link() Antecedent");
}

TEST_F(Built_Walks, FiltersThatAreNullAndEmptyAreTheSame) {
  play("TEST_Link", OPERATION_ENUM_ASSOCIATOR_NAMES, "0");
  play("TEST_Link", OPERATION_ENUM_REFERENCES, "0");
  auto* face =
      static_cast<CMPIAssociationMI*>(broker.interface("TEST_Link", InterfaceKind::Association));
  for (const char* filter : {static_cast<const char*>(nullptr), ""}) {
    Straight_Call direct(broker);
    const CMPIObjectPath* from = direct.path(source);
    EXPECT_EQ(face->ft
                  ->associatorNames(face, direct.context, direct.result, from, filter, filter,
                                    filter, filter)
                  .rc,
              CMPI_RC_OK);
    EXPECT_STREQ(control->asked(), "names TEST_Element(Id=\"e\") //\n");
    EXPECT_EQ(
        face->ft->referenceNames(face, direct.context, direct.result, from, filter, filter).rc,
        CMPI_RC_OK);
    EXPECT_STREQ(control->asked(), "references TEST_Element(Id=\"e\") TEST_Link() \n");
  }
}

TEST_F(Built_Walks, AProvidersOwnAssociatorsAreConvertedWithAWarning) {
  play("TEST_Link", OPERATION_ENUM_ASSOCIATORS, "deliver root/own:TEST_Part(Id=p, Caption=c)");
  Request wish = request(Call::Associators, source);
  wish.properties = {{"Caption"}};
  const Reply reply = run(wish);
  EXPECT_EQ(reply.status.rc, CMPI_RC_OK);
  ASSERT_EQ(reply.instances.size(), 1U);
  EXPECT_EQ(reply.instances[0].path.nameSpace, "root/own");
  EXPECT_TRUE(reply.instances[0].has("Caption"));
  EXPECT_FALSE(reply.instances[0].has("Id"));
  EXPECT_THAT(texts("WARN"), ElementsAre("No ObjectPath built before call to make_CMPI_instance"));
  EXPECT_EQ(control->count("TEST_Part", OPERATION_GET_INSTANCE), 0U);
}

TEST_F(Built_Walks, ReferencesDropTheKeysThatAreNotListedAndShowNullsWithoutAList) {
  Request wish = request(Call::References, source);
  wish.properties = {{"Note", "NoSuch"}};
  const Reply listed = run(wish);
  ASSERT_EQ(listed.instances.size(), 2U);
  EXPECT_EQ(listed.instances[0].properties, (NamedValues{{"Note", Any::string("n")}}));
  EXPECT_EQ(listed.instances[0].path.keys.size(), 2U);

  play("TEST_Link", OPERATION_ENUM_INSTANCES,
       "deliver TEST_Link(Antecedent=TEST_Element(Id=e), Dependent=TEST_Part(Id=p))");
  const Reply whole = walk(Call::References, source);
  ASSERT_EQ(whole.instances.size(), 1U);
  EXPECT_EQ(whole.instances[0].property("Note"), Any::string("")) << "the provider left it null";
}

TEST_F(Built_Walks, AssociatorsAreAskedForWithTheListOfTheRequest) {
  Request wish = request(Call::Associators, source);
  wish.properties = {{"Size"}};
  const Reply reply = run(wish);
  ASSERT_EQ(reply.instances.size(), 2U);
  EXPECT_FALSE(reply.instances[0].has("Caption"));
  EXPECT_EQ(std::count(asked.begin(), asked.end(), "get TEST_Part(Id=\"p1\", Size=0)"), 1);
}

TEST_F(Built_Walks, NamespacesOfFarEndsWinOverTheRequestsAndThoseOfLinksDoNot) {
  play("TEST_Link", OPERATION_ENUM_INSTANCES,
       "deliver root/link:TEST_Link(Antecedent=TEST_Element(Id=e), "
       "Dependent=root/own:TEST_Part(Id=p))");
  EXPECT_EQ(walk(Call::AssociatorNames, source).paths.at(0).nameSpace, "root/own");
  const Reply names = walk(Call::ReferenceNames, source);
  EXPECT_EQ(names.paths.at(0).nameSpace, NAME_SPACE);
  EXPECT_EQ(names.paths.at(0).key("Dependent").asReference().nameSpace, "root/own");
  EXPECT_EQ(walk(Call::References, source).instances.at(0).path.nameSpace, NAME_SPACE);
}

TEST_F(Built_Walks, AnAssociatorThatTheServerDoesNotHaveEndsTheDeliveryWithSuccess) {
  play("TEST_Part", OPERATION_GET_INSTANCE, "60");
  const Reply reply = walk(Call::Associators, source);
  EXPECT_EQ(reply.status.rc, CMPI_RC_OK);
  EXPECT_EQ(size(reply), 0U);
  EXPECT_EQ(ending(), "associators(): CMPI_RC_OK");
  EXPECT_EQ(
      std::count(asked.begin(), asked.end(), "get TEST_Part(Id=\"p1\", Caption=\"\", Size=0)"), 1);
  EXPECT_EQ(asked.back(), "wanted") << "the walk itself goes on";
}

TEST_F(Built_Walks, BothEndsOfOneClass) {
  play("TEST_Peer", OPERATION_ENUM_INSTANCES,
       "deliver TEST_Peer(Left=TEST_Part(Id=a), Right=TEST_Part(Id=b)); "
       "deliver TEST_Peer(Left=TEST_Part(Id=a), Right=TEST_Part(Id=a))");
  const Reply names = walk(Call::AssociatorNames, path("TEST_Part", "a"), "TEST_Peer");
  ASSERT_EQ(names.paths.size(), 1U) << "equal ends are both the source";
  EXPECT_EQ(names.paths[0].key("Id").asText(), "b");
  EXPECT_EQ(walk(Call::ReferenceNames, path("TEST_Part", "a"), "TEST_Peer").paths.size(), 2U);
}

TEST_F(Built_Walks, ThreeEndsGiveTwoFarOnes) {
  play("TEST_Triple", OPERATION_ENUM_INSTANCES,
       "deliver TEST_Triple(First=TEST_Element(Id=a), Second=TEST_Part(Id=b), "
       "Third=TEST_Spare(Id=c))");
  Request wish = request(Call::AssociatorNames, path("TEST_Part", "b"), "TEST_Triple");
  EXPECT_EQ(run(wish).paths.size(), 2U);
  wish.role = "second";
  wish.resultRole = "THIRD";
  const Reply one = run(wish);
  ASSERT_EQ(one.paths.size(), 1U);
  EXPECT_EQ(one.paths[0].className, "TEST_Spare");
  wish.role = "First";
  EXPECT_EQ(run(wish).paths.size(), 0U);
  wish.role = "";
  wish.resultRole = "";
  wish.resultClass = "TEST_Element";
  EXPECT_EQ(run(wish).paths.size(), 2U) << "an ancestor fits every end";
  wish.resultClass = "TEST_Spare";
  EXPECT_EQ(run(wish).paths.size(), 1U);
  wish.resultClass = "TEST_Link";
  EXPECT_EQ(run(wish).paths.size(), 0U);
}

// ---- Results that cannot be made

TEST_F(Built_Walks, NamesEndTheirDeliveryWhereInstancesPassOver) {
  play("TEST_Part", OPERATION_ENUM_INSTANCES,
       "deliver TEST_Part(Id=a); deliver TEST_Part(Id=b); deliver TEST_Part(Id=c)");
  put_before("TEST_Part");
  const struct {
    Call call;
    const char* name;
  } rows[] = {{Call::EnumerateInstanceNames, "enumInstanceNames"},
              {Call::EnumerateInstances, "enumInstances"}};
  for (const auto& row : rows) {
    faulty.fail("newObjectPath", 2);
    control->asked();
    const Trace_Log log;
    const Reply reply = broker.run(request(row.call, {"", NAME_SPACE, "TEST_Part", {}}));
    EXPECT_EQ(reply.status.rc, CMPI_RC_OK) << row.name;
    EXPECT_TRUE(reply.done) << row.name;
    EXPECT_EQ(size(reply), 1U) << row.name;
    EXPECT_TRUE(log.has("DBG", "return: " + std::string(row.name) + "(): CMPI_RC_OK"));
    EXPECT_THAT(std::string(control->asked()), ::testing::EndsWith("wanted\nno more\nno more\n"));
    faulty.heal();
  }
}

TEST_F(Built_Walks, AWalkThatCannotMakeAResultIsASuccess) {
  put_before<CMPIAssociationMI>("TEST_Link", 'A', faulty.face());
  for (const auto& [call, name] : calls) {
    faulty.fail("newObjectPath", 1);
    control->asked();
    const Trace_Log log;
    const Reply reply = broker.run(request(call, source));
    EXPECT_EQ(reply.status.rc, CMPI_RC_OK) << name;
    EXPECT_EQ(size(reply), 0U) << name;
    EXPECT_FALSE(reply.report.leaks());
    EXPECT_TRUE(log.has("DBG", "return: " + std::string(name) + "(): CMPI_RC_OK")) << name;
    // The walk itself hears nothing of it.
    EXPECT_THAT(std::string(control->asked()), ::testing::EndsWith("wanted\nwanted\n")) << name;
    faulty.heal();
    EXPECT_EQ(size(broker.run(request(call, source))), 2U) << name;
  }
}

TEST_F(Built_Walks, OwnAnswersOfAProviderHearOfAFailureInTheNamesAlone) {
  put_before<CMPIAssociationMI>("TEST_Link", 'A', faulty.face());
  const std::string parts = "deliver root/test:TEST_Part(Id=a); deliver root/test:TEST_Part(Id=b)";
  play("TEST_Link", OPERATION_ENUM_ASSOCIATOR_NAMES, parts);
  play("TEST_Link", OPERATION_ENUM_ASSOCIATORS, parts);
  play("TEST_Link", OPERATION_ENUM_REFERENCES, std::string(LINK_1) + "; " + LINK_2);
  for (const auto& [call, name] : calls) {
    faulty.fail("newObjectPath", 1);
    control->asked();
    const Reply reply = broker.run(request(call, source));
    EXPECT_EQ(reply.status.rc, CMPI_RC_OK) << name;
    EXPECT_EQ(size(reply), 0U) << name;
    const bool names = call == Call::AssociatorNames || call == Call::ReferenceNames;
    EXPECT_THAT(std::string(control->asked()),
                ::testing::EndsWith(names ? "no more\nno more\n" : "wanted\nwanted\n"))
        << name;
    faulty.heal();
  }
}

TEST_F(Built_Walks, TheCodeOfAConversionIsAnswered) {
  put_before("TEST_Part");
  play("TEST_Part", OPERATION_GET_INSTANCE, "out TEST_Part(Id=a)");
  play("TEST_Part", OPERATION_CREATE_INSTANCE, "0");
  const auto expect_failed = [&](Call call, const char* function, const char* name) {
    Request wish = request(call, path("TEST_Part", "a"));
    wish.instance = object("TEST_Part", {{"Id", Any::string("a")}});
    faulty.fail(function, 1);
    const Trace_Log log;
    const Reply reply = broker.run(wish);
    EXPECT_EQ(reply.status.rc, CMPI_RC_ERR_FAILED) << name;
    EXPECT_FALSE(reply.done) << name;
    EXPECT_EQ(size(reply), 0U) << name;
    EXPECT_TRUE(log.has("DBG", "return: " + std::string(name) + "(): CMPI_RC_ERR_FAILED")) << name;
    faulty.heal();
  };
  expect_failed(Call::GetInstance, "newInstance", "getInstance");
  expect_failed(Call::CreateInstance, "newObjectPath", "createInstance");
}

CMPIStatus refuse_filter(CMPIInstance*, const char**, const char**) {
  return {static_cast<CMPIrc>(99), nullptr};
}

/// Makes instances that refuse every property list with a code that has no name.
CMPIInstance* unfilterable(const CMPIBroker*, const CMPIObjectPath*, CMPIStatus*) {
  static CMPIInstanceFT table = [] {
    CMPIInstanceFT made = {};
    made.release = [](CMPIInstance*) { return CMPIStatus{CMPI_RC_OK, nullptr}; };
    made.setPropertyFilter = &refuse_filter;
    return made;
  }();
  static CMPIInstance target = {nullptr, &table};
  return &target;
}

TEST_F(Built_Walks, ACodeWithoutANameIsAnsweredAsItIsAndLoggedAsAFailure) {
  CMPIBrokerEncFT makers = *faulty.face()->eft;
  makers.newInstance = &unfilterable;
  CMPIBroker face = *faulty.face();
  face.eft = &makers;
  put_before<CMPIInstanceMI>("TEST_Part", 'I', &face);
  play("TEST_Part", OPERATION_GET_INSTANCE, "out TEST_Part(Id=a)");
  Request wish = request(Call::GetInstance, path("TEST_Part", "a"));
  wish.properties = {{"Size"}};
  const Trace_Log log;
  EXPECT_EQ(broker.run(wish).status.rc, 99);
  EXPECT_TRUE(log.has("DBG", "return: getInstance(): CMPI_RC_ERR_FAILED"));
}

}  // namespace
}  // namespace cimrt::test
