// Association operations: provider answers, default walks, and the places where they differ.
#include <gmock/gmock.h>

#include <stdexcept>

#include "Test_Instances.h"
#include "Test_Server.h"
#include "Trace_Log.h"
#include "runtime/Thread_Context.h"

namespace cimrt::test {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::SizeIs;
using tvx::host::ObjectPath;
using tvx::host::Operation;
using tvx::host::Reply;
using tvx::host::Request;
using Any = tvx::host::Value;

std::vector<std::string> ids(const Reply& reply) {
  std::vector<std::string> result;
  for (const ObjectPath& path : reply.paths) result.push_back(path.key("Id").asText());
  for (const tvx::host::Instance& object : reply.instances) result.push_back(object.text("Id"));
  return result;
}

class Association_Operations : public ::testing::Test {
 protected:
  Association_Operations() {
    server.serve<0>(link, classes.link);
    server.serve<1>(parts, classes.part);
    server.serve<2>(elements, classes.element);
    serve_instances(parts, classes.part);
    serve_instances(elements, classes.element);
    link.enumerate = [this](const Instance*, const Instance_Handler& handler) {
      for (const auto& [antecedent, dependent] : links)
        if (!handler.handle(make_link(antecedent, dependent))) return 0;
      return 0;
    };
  }

  /// Serves whatever instance of a class the server asks for.
  static void serve_instances(Script& script, const Meta_Class* meta_class) {
    script.get = [meta_class](const Instance* model, Instance*& out) {
      Ref<Instance> made = make_element(meta_class, take<String>(model, "Id").c_str());
      put(made, "Caption", "served");
      out = made.release();
      return 0;
    };
  }
  Instance* make_link(const char* antecedent, const char* dependent) const {
    Ref<Instance> made = make_instance(classes.link);
    refer(made.get(), "Antecedent", make_element(classes.element, antecedent).get());
    refer(made.get(), "Dependent", make_element(classes.part, dependent).get());
    put(made, "Note", "noted");
    return made.release();
  }
  Request request(Operation operation, const ObjectPath& source) const {
    Request made;
    made.operation = operation;
    made.path = source;
    made.assocClass = "TEST_Link";
    made.resultClass = operation == Operation::References || operation == Operation::ReferenceNames
                           ? "TEST_Link"
                           : "";
    made.exact = true;
    return made;
  }
  Reply run(Operation operation, const ObjectPath& source) {
    return server.broker.run(request(operation, source));
  }
  static constexpr Operation all[] = {Operation::Associators, Operation::AssociatorNames,
                                      Operation::References, Operation::ReferenceNames};

  const Test_Classes& classes = Test_Classes::get();
  std::vector<std::pair<const char*, const char*>> links = {
      {"e1", "p1"}, {"e1", "p2"}, {"e2", "p2"}};
  Script link;
  Script parts;
  Script elements;
  Test_Server server;
  ObjectPath e1 = path_of("TEST_Element", "e1");
  ObjectPath p2 = path_of("TEST_Part", "p2");
};

// ---- The default walks

TEST_F(Association_Operations, AssociatorNamesDeliverExactlyTheOtherEnds) {
  const Reply from_element = run(Operation::AssociatorNames, e1);
  EXPECT_EQ(from_element.status.rc, CMPI_RC_OK);
  EXPECT_THAT(ids(from_element), ElementsAre("p1", "p2"));
  EXPECT_EQ(from_element.paths[0].className, "TEST_Part");
  EXPECT_EQ(from_element.paths[0].nameSpace, "root/test");
  EXPECT_FALSE(from_element.report.leaks());

  const Reply from_part = run(Operation::AssociatorNames, p2);
  EXPECT_THAT(ids(from_part), ElementsAre("e1", "e2"));
  EXPECT_THAT(ids(run(Operation::AssociatorNames, path_of("TEST_Part", "p9"))), IsEmpty());
}

TEST_F(Association_Operations, AssociatorsAreFetchedFromTheServer) {
  const Reply reply = run(Operation::Associators, e1);
  EXPECT_EQ(reply.status.rc, CMPI_RC_OK);
  EXPECT_THAT(ids(reply), ElementsAre("p1", "p2"));
  EXPECT_EQ(reply.instances[0].text("Caption"), "served");
  EXPECT_EQ(parts.count(OPERATION_GET_INSTANCE), 2u);
  EXPECT_FALSE(reply.report.leaks());
}

TEST_F(Association_Operations, AssociatorsPassThePropertyListToTheServer) {
  Request asked = request(Operation::Associators, e1);
  asked.properties = {{"Id"}};
  const Reply reply = server.broker.run(asked);
  ASSERT_THAT(reply.instances, SizeIs(2));
  EXPECT_FALSE(reply.instances[0].has("Caption"));
  EXPECT_TRUE(reply.instances[0].has("Id"));
}

TEST_F(Association_Operations, AnAssociatorThatTheServerDoesNotHaveEndsTheDelivery) {
  parts.get = [this](const Instance* model, Instance*& out) {
    if (take<String>(model, "Id") == "p1") return 60;
    out = make_element(classes.part, "p2").release();
    return 0;
  };
  const Reply reply = run(Operation::Associators, e1);
  EXPECT_EQ(reply.status.rc, CMPI_RC_OK);
  EXPECT_THAT(reply.instances, IsEmpty());
  EXPECT_EQ(parts.count(OPERATION_GET_INSTANCE), 1u);
}

TEST_F(Association_Operations, ReferenceNamesDeliverTheAssociationsPaths) {
  const Reply reply = run(Operation::ReferenceNames, p2);
  EXPECT_EQ(reply.status.rc, CMPI_RC_OK);
  ASSERT_THAT(reply.paths, SizeIs(2));
  EXPECT_EQ(reply.paths[0].className, "TEST_Link");
  EXPECT_EQ(reply.paths[0].nameSpace, "root/test");
  EXPECT_EQ(reply.paths[0].key("Antecedent").asReference().key("Id").asText(), "e1");
  EXPECT_EQ(reply.paths[1].key("Antecedent").asReference().key("Id").asText(), "e2");
}

TEST_F(Association_Operations, ReferencesDeliverTheAssociations) {
  const Reply reply = run(Operation::References, p2);
  EXPECT_EQ(reply.status.rc, CMPI_RC_OK);
  ASSERT_THAT(reply.instances, SizeIs(2));
  EXPECT_EQ(reply.instances[0].text("Note"), "noted");
  EXPECT_EQ(reply.instances[0].property("Dependent").asReference().key("Id").asText(), "p2");
}

TEST_F(Association_Operations, ReferencesHonourThePropertyList) {
  Request asked = request(Operation::References, p2);
  asked.properties = {{"Antecedent"}};
  const Reply reply = server.broker.run(asked);
  ASSERT_THAT(reply.instances, SizeIs(2));
  EXPECT_FALSE(reply.instances[0].has("Note"));
  EXPECT_TRUE(reply.instances[0].has("Antecedent"));
}

TEST_F(Association_Operations, AReferenceWithoutAListShowsEveryProperty) {
  link.enumerate = [this](const Instance*, const Instance_Handler& handler) {
    Ref<Instance> made(make_link("e1", "p2"));
    nullify_properties(made.get(), false, true, true);
    handler.handle(made.release());
    return 0;
  };
  const Reply reply = run(Operation::References, p2);
  ASSERT_THAT(reply.instances, SizeIs(1));
  EXPECT_TRUE(reply.instances[0].has("Note"));
}

TEST_F(Association_Operations, ARoleNamesTheEndOfTheSource) {
  for (const Operation operation : all) {
    Request asked = request(operation, p2);
    asked.role = "dependent";
    const Reply same = server.broker.run(asked);
    EXPECT_EQ(same.paths.size() + same.instances.size(), 2u) << operationName(operation);
    asked.role = "Antecedent";
    const Reply other = server.broker.run(asked);
    EXPECT_EQ(other.status.rc, CMPI_RC_OK);
    EXPECT_EQ(other.paths.size() + other.instances.size(), 0u) << operationName(operation);
  }
}

TEST_F(Association_Operations, AResultClassMayBeAnAncestor) {
  for (const Operation operation : {Operation::Associators, Operation::AssociatorNames}) {
    Request asked = request(operation, e1);
    for (const char* fits : {"TEST_Part", "test_element", "TEST_Element"}) {
      asked.resultClass = fits;
      EXPECT_THAT(ids(server.broker.run(asked)), SizeIs(2)) << fits;
    }
    asked.resultClass = "TEST_Spare";
    EXPECT_THAT(ids(server.broker.run(asked)), IsEmpty());
  }
}

TEST_F(Association_Operations, AResultRoleNamesTheFarEnd) {
  for (const Operation operation : {Operation::Associators, Operation::AssociatorNames}) {
    Request asked = request(operation, e1);
    asked.resultRole = "DEPENDENT";
    EXPECT_THAT(ids(server.broker.run(asked)), SizeIs(2));
    asked.resultRole = "Antecedent";
    EXPECT_THAT(ids(server.broker.run(asked)), IsEmpty());
  }
}

TEST_F(Association_Operations, TheAssociationClassOfTheRequestHasNoEffect) {
  server.add<0>("TEST_Other");
  for (const Operation operation : all) {
    Request asked = request(operation, p2);
    asked.assocClass = "TEST_Other";
    if (operation == Operation::References || operation == Operation::ReferenceNames)
      asked.resultClass = "TEST_Other";
    const Reply reply = server.broker.run(asked);
    EXPECT_EQ(reply.paths.size() + reply.instances.size(), 2u) << operationName(operation);
  }
}

TEST_F(Association_Operations, AThreeWayAssociationDeliversBothOtherEnds) {
  Script triple;
  Test_Server other;
  other.serve<3>(triple, classes.triple);
  triple.enumerate = [this](const Instance*, const Instance_Handler& handler) {
    Ref<Instance> made = make_instance(classes.triple);
    refer(made.get(), "First", make_element(classes.element, "a").get());
    refer(made.get(), "Second", make_element(classes.part, "b").get());
    refer(made.get(), "Third", make_element(classes.spare, "c").get());
    handler.handle(made.release());
    return 0;
  };
  Request asked = request(Operation::AssociatorNames, path_of("TEST_Part", "b"));
  asked.assocClass = "TEST_Triple";
  EXPECT_THAT(ids(other.broker.run(asked)), ElementsAre("a", "c"));
  asked.role = "Second";
  asked.resultRole = "Third";
  EXPECT_THAT(ids(other.broker.run(asked)), ElementsAre("c"));
}

TEST_F(Association_Operations, EqualEndsAreBothTheSource) {
  Script peer;
  Test_Server other;
  other.serve<3>(peer, classes.peer);
  peer.enumerate = [this](const Instance*, const Instance_Handler& handler) {
    for (const char* right : {"b", "a"}) {
      Ref<Instance> made = make_instance(classes.peer);
      refer(made.get(), "Left", make_element(classes.part, "a").get());
      refer(made.get(), "Right", make_element(classes.part, right).get());
      handler.handle(made.release());
    }
    return 0;
  };
  Request asked = request(Operation::AssociatorNames, path_of("TEST_Part", "a"));
  asked.assocClass = "TEST_Peer";
  EXPECT_THAT(ids(other.broker.run(asked)), ElementsAre("b"));
}

TEST_F(Association_Operations, AFarEndKeepsItsOwnNamespace) {
  link.enumerate = [this](const Instance*, const Instance_Handler& handler) {
    Ref<Instance> made = make_instance(classes.link);
    refer(made.get(), "Antecedent", make_element(classes.element, "e1").get());
    Ref<Instance> part = make_element(classes.part, "p1");
    part->__name_space = "root/elsewhere";
    refer(made.get(), "Dependent", part.get());
    made->__name_space = "root/third";
    handler.handle(made.release());
    return 0;
  };
  const Reply names = run(Operation::AssociatorNames, e1);
  ASSERT_THAT(names.paths, SizeIs(1));
  EXPECT_EQ(names.paths[0].nameSpace, "root/elsewhere");
  const Reply references = run(Operation::ReferenceNames, e1);
  ASSERT_THAT(references.paths, SizeIs(1));
  EXPECT_EQ(references.paths[0].nameSpace, "root/test");
  EXPECT_EQ(references.paths[0].key("Dependent").asReference().nameSpace, "root/elsewhere");
}

TEST_F(Association_Operations, TheWalksWantTheRightModels) {
  std::vector<bool> note_null;
  const auto base = link.enumerate;
  link.enumerate = [&](const Instance* model, const Instance_Handler& handler) {
    EXPECT_EQ(class_of(model), classes.link);
    note_null.push_back(null_in(model, "Note"));
    return base(model, handler);
  };
  run(Operation::ReferenceNames, p2);
  run(Operation::References, p2);
  run(Operation::AssociatorNames, p2);
  EXPECT_THAT(note_null, ElementsAre(true, false, true));
}

// ---- Unknown classes, and classes that are no association

TEST_F(Association_Operations, AnUnknownSourceClassIsAnEmptySuccess) {
  const std::map<Operation, std::pair<std::string, std::string>> lines = {
      {Operation::Associators, {"associators", "CMPI_RC_OK"}},
      {Operation::AssociatorNames, {"associatorNames", "CMPI_RC_ERR_INVALID_CLASS"}},
      {Operation::References, {"references", "CMPI_RC_ERR_INVALID_CLASS"}},
      {Operation::ReferenceNames, {"referenceNames", "CMPI_RC_ERR_INVALID_CLASS"}}};
  server.broker.interface("TEST_Link", tvx::host::InterfaceKind::Association);
  for (const auto& [operation, line] : lines) {
    Trace_Log log;
    const Reply reply = run(operation, path_of("TEST_Unknown", "x"));
    EXPECT_EQ(reply.status.rc, CMPI_RC_OK);
    EXPECT_EQ(reply.paths.size() + reply.instances.size(), 0u);
    EXPECT_THAT(log.texts("DBG"), ElementsAre("enter: " + line.first + "()",
                                              "return: " + line.first + "(): " + line.second));
  }
  EXPECT_EQ(link.count(OPERATION_ENUM_INSTANCES), 0u);
}

TEST_F(Association_Operations, AClassThatIsNoAssociationFailsInTheWalks) {
  server.add<2>("TEST_NoAssociation");
  elements.enumerate = nullptr;
  for (const Operation operation : all) {
    Request asked = request(operation, e1);
    asked.assocClass = "TEST_NoAssociation";
    asked.resultClass = operation == Operation::References || operation == Operation::ReferenceNames
                            ? "TEST_NoAssociation"
                            : "";
    const Reply reply = server.broker.run(asked);
    EXPECT_EQ(reply.status.rc, CMPI_RC_ERR_FAILED) << operationName(operation);
    EXPECT_EQ(reply.paths.size() + reply.instances.size(), 0u);
  }
  EXPECT_EQ(elements.count(OPERATION_ENUM_INSTANCES), 0u);
  EXPECT_EQ(elements.count(OPERATION_ENUM_REFERENCES), 0u);
  EXPECT_EQ(elements.count(OPERATION_ENUM_ASSOCIATOR_NAMES), 0u);
}

// ---- Statuses

TEST_F(Association_Operations, ReferencesMapTheProvidersStatus) {
  const std::map<int, CMPIrc> codes = {
      {0, CMPI_RC_OK}, {120, CMPI_RC_ERR_FAILED}, {122, CMPI_RC_ERR_ACCESS_DENIED}};
  for (const Operation operation : {Operation::References, Operation::ReferenceNames})
    for (const auto& [status, code] : codes) {
      link.statuses[OPERATION_ENUM_REFERENCES] = status;
      const Reply reply = run(operation, p2);
      EXPECT_EQ(reply.status.rc, code) << status;
      EXPECT_EQ(reply.paths.size() + reply.instances.size(), 0u);
    }
  EXPECT_EQ(link.count(OPERATION_ENUM_INSTANCES), 0u);
}

TEST_F(Association_Operations, AnUnlistedReferencesStatusStartsTheWalk) {
  for (const int status : {121, -1, 5}) {
    link.statuses[OPERATION_ENUM_REFERENCES] = status;
    EXPECT_THAT(run(Operation::ReferenceNames, p2).paths, SizeIs(2)) << status;
  }
}

TEST_F(Association_Operations, ReferencesMapTheStatusOfTheEnumeration) {
  link.enumerate = nullptr;
  const std::map<int, CMPIrc> codes = {
      {70, CMPI_RC_ERR_FAILED}, {71, CMPI_RC_ERR_ACCESS_DENIED}, {5, CMPI_RC_OK}};
  for (const Operation operation : all)
    for (const auto& [status, code] : codes) {
      link.statuses[OPERATION_ENUM_INSTANCES] = status;
      EXPECT_EQ(run(operation, p2).status.rc, code) << operationName(operation) << status;
    }
}

TEST_F(Association_Operations, AssociatorNamesDoNotTellDeniedAccessFromFailure) {
  const std::map<int, CMPIrc> codes = {
      {0, CMPI_RC_OK}, {110, CMPI_RC_ERR_FAILED}, {112, CMPI_RC_ERR_FAILED}};
  for (const auto& [status, code] : codes) {
    link.statuses[OPERATION_ENUM_ASSOCIATOR_NAMES] = status;
    EXPECT_EQ(run(Operation::AssociatorNames, p2).status.rc, code) << status;
  }
  EXPECT_EQ(link.count(OPERATION_ENUM_INSTANCES), 0u);
  link.statuses[OPERATION_ENUM_ASSOCIATOR_NAMES] = 5;
  EXPECT_THAT(run(Operation::AssociatorNames, p2).paths, SizeIs(2));
}

TEST_F(Association_Operations, AssociatorsMapTheProvidersStatus) {
  const std::map<int, CMPIrc> codes = {
      {0, CMPI_RC_OK}, {170, CMPI_RC_ERR_FAILED}, {172, CMPI_RC_ERR_ACCESS_DENIED}};
  for (const auto& [status, code] : codes) {
    link.statuses[OPERATION_ENUM_ASSOCIATORS] = status;
    EXPECT_EQ(run(Operation::Associators, p2).status.rc, code) << status;
  }
  EXPECT_EQ(link.count(OPERATION_ENUM_INSTANCES), 0u);
  for (const int status : {171, -1, 5}) {
    link.statuses[OPERATION_ENUM_ASSOCIATORS] = status;
    EXPECT_THAT(run(Operation::Associators, p2).instances, SizeIs(2)) << status;
  }
}

TEST_F(Association_Operations, AssociatorsThatFallBackMapTheStatusOfTheNames) {
  for (const int status : {110, 112}) {
    link.statuses[OPERATION_ENUM_ASSOCIATOR_NAMES] = status;
    EXPECT_EQ(run(Operation::Associators, p2).status.rc, CMPI_RC_ERR_FAILED) << status;
  }
}

// ---- Providers with answers of their own

TEST_F(Association_Operations, AProvidersOwnAssociatorsAreConvertedHere) {
  link.associators = [this](const Instance* source, const String& result_class, const String& role,
                            const String& result_role, const Instance_Handler& handler) {
    EXPECT_EQ(take<String>(source, "Id"), "e1");
    EXPECT_EQ(result_class, "TEST_Part");
    EXPECT_EQ(role, "Antecedent");
    EXPECT_EQ(result_role, "");
    Ref<Instance> part = make_element(classes.part, "own");
    put(part, "Caption", "mine");
    part->__name_space = "root/elsewhere";
    handler.handle(part.release());
    return 0;
  };
  Request asked = request(Operation::Associators, e1);
  asked.resultClass = "TEST_Part";
  asked.role = "Antecedent";
  asked.properties = {{"Caption"}};
  Trace_Log log;
  const Reply reply = server.broker.run(asked);
  EXPECT_EQ(reply.status.rc, CMPI_RC_OK);
  ASSERT_THAT(reply.instances, SizeIs(1));
  EXPECT_EQ(reply.instances[0].text("Caption"), "mine");
  EXPECT_FALSE(reply.instances[0].has("Id"));
  EXPECT_EQ(reply.instances[0].path.nameSpace, "root/elsewhere");
  EXPECT_EQ(parts.count(OPERATION_GET_INSTANCE), 0u);
  EXPECT_TRUE(log.has("WARN", "No ObjectPath built before call to make_CMPI_instance"));
}

TEST_F(Association_Operations, AProvidersOwnNamesAreReturned) {
  link.associator_names = [this](const Instance*, const String&, const String&, const String&,
                                 const Instance_Handler& handler) {
    handler.handle(make_element(classes.part, "own").release());
    return 0;
  };
  EXPECT_THAT(ids(run(Operation::AssociatorNames, e1)), ElementsAre("own"));
  EXPECT_EQ(link.count(OPERATION_ENUM_INSTANCES), 0u);
}

TEST_F(Association_Operations, AProvidersOwnReferencesAreReturned) {
  link.references = [this](const Instance*, const Instance* model, const String& role,
                           const Instance_Handler& handler) {
    EXPECT_EQ(class_of(model), classes.link);
    EXPECT_EQ(role, "Dependent");
    handler.handle(make_link("x", "y"));
    return 0;
  };
  Request asked = request(Operation::ReferenceNames, p2);
  asked.role = "Dependent";
  const Reply reply = server.broker.run(asked);
  ASSERT_THAT(reply.paths, SizeIs(1));
  EXPECT_EQ(reply.paths[0].key("Dependent").asReference().key("Id").asText(), "y");
}

TEST_F(Association_Operations, WhatAProviderThrowsEndsAsAFailure) {
  link.enumerate = [this](const Instance*, const Instance_Handler& handler) -> std::int32_t {
    handler.handle(make_link("e1", "p2"));
    throw std::runtime_error("broken");
  };
  for (const Operation operation : all) {
    const Reply reply = run(operation, p2);
    EXPECT_EQ(reply.status.rc, CMPI_RC_ERR_FAILED) << operationName(operation);
    EXPECT_FALSE(reply.report.leaks());
  }
  EXPECT_EQ(Thread_Context::top(), nullptr);
}

}  // namespace
}  // namespace cimrt::test
