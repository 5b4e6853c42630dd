// Every status that a provider can answer, through the built library: what the server gets and what
// the log tells.
#include "Built_Fixture.h"

namespace cimrt::test {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;

struct Row {
  std::uint32_t operation;
  Call call;
  const char* steps;  ///< of the provider
  int code;           ///< what the server gets
  bool done;          ///< whether the end of the results was told
  std::size_t results;
  const char* ending;  ///< of the return line in the log
};

constexpr auto GET = OPERATION_GET_INSTANCE;
constexpr auto ENUM = OPERATION_ENUM_INSTANCES;
constexpr auto CREATE = OPERATION_CREATE_INSTANCE;
constexpr auto DELETE = OPERATION_DELETE_INSTANCE;
constexpr auto MODIFY = OPERATION_MODIFY_INSTANCE;
constexpr auto INVOKE = OPERATION_INVOKE_METHOD;
constexpr auto NAMES = OPERATION_ENUM_ASSOCIATOR_NAMES;
constexpr auto REFERENCES = OPERATION_ENUM_REFERENCES;
constexpr auto ASSOCIATORS = OPERATION_ENUM_ASSOCIATORS;

class Statuses : public Built_Bridge {
 protected:
  void expect_row(const Row& row, Request asked_for, const char* class_name) {
    play(class_name, row.operation, row.steps);
    const Reply reply = run(asked_for);
    const std::string name = std::string(operationName(row.call)) + ": " + row.steps;
    EXPECT_EQ(reply.status.rc, row.code) << name;
    EXPECT_EQ(reply.done, row.done) << name;
    EXPECT_EQ(reply.instances.size() + reply.paths.size() + reply.data.size(), row.results) << name;
    EXPECT_EQ(ending(), row.ending) << name;
    // Whatever a provider answers is told at the level of a trace and no other.
    EXPECT_EQ(texts("DBG").size(), lines.size()) << name;
    EXPECT_EQ(reply.report.count(reply.report.leftBehind), 0U) << name << reply.report.text();
  }
};

// ---- Instances

const Row instance_rows[] = {
    {GET, Call::GetInstance, "out TEST_Part(Id=a); 0", 0, true, 1, "getInstance(): CMPI_RC_OK"},
    {GET, Call::GetInstance, "60", 6, false, 0, "getInstance(): CMPI_RC_ERR_NOT_FOUND"},
    {GET, Call::GetInstance, "out TEST_Part(Id=a); 60", 6, false, 0,
     "getInstance(): CMPI_RC_ERR_NOT_FOUND"},
    {GET, Call::GetInstance, "61", 6, false, 0, "getInstance(): CMPI_RC_ERR_NOT_FOUND"},
    {GET, Call::GetInstance, "62", 4, false, 0, "getInstance(): CMPI_RC_ERR_INVALID_PARAMETER"},
    {GET, Call::GetInstance, "63", 2, false, 0, "getInstance(): CMPI_RC_ERR_ACCESS_DENIED"},
    {GET, Call::GetInstance, "64", 1, false, 0, "getInstance(): CMPI_RC_ERR_FAILED"},
    // Numbers that no list names count as success.
    {GET, Call::GetInstance, "out TEST_Part(Id=a); 65", 0, true, 1, "getInstance(): CMPI_RC_OK"},
    {GET, Call::GetInstance, "out TEST_Part(Id=a); -1", 0, true, 1, "getInstance(): CMPI_RC_OK"},
    {GET, Call::GetInstance, "out TEST_Part(Id=a); 70", 0, true, 1, "getInstance(): CMPI_RC_OK"},

    {ENUM, Call::EnumerateInstanceNames, "deliver TEST_Part(Id=a); 0", 0, true, 1,
     "enumInstanceNames(): CMPI_RC_OK"},
    {ENUM, Call::EnumerateInstanceNames, "deliver TEST_Part(Id=a); 70", 1, false, 1,
     "enumInstanceNames(): CMPI_RC_ERR_FAILED"},
    {ENUM, Call::EnumerateInstanceNames, "71", 2, false, 0,
     "enumInstanceNames(): CMPI_RC_ERR_ACCESS_DENIED"},
    // Of the two enumerations this one does not tell the end with an unlisted status.
    {ENUM, Call::EnumerateInstanceNames, "deliver TEST_Part(Id=a); 72", 0, false, 1,
     "enumInstanceNames(): CMPI_RC_OK"},
    {ENUM, Call::EnumerateInstanceNames, "-1", 0, false, 0, "enumInstanceNames(): CMPI_RC_OK"},
    {ENUM, Call::EnumerateInstances, "deliver TEST_Part(Id=a); 0", 0, true, 1,
     "enumInstances(): CMPI_RC_OK"},
    {ENUM, Call::EnumerateInstances, "deliver TEST_Part(Id=a); 70", 1, false, 1,
     "enumInstances(): CMPI_RC_ERR_FAILED"},
    {ENUM, Call::EnumerateInstances, "71", 2, false, 0,
     "enumInstances(): CMPI_RC_ERR_ACCESS_DENIED"},
    {ENUM, Call::EnumerateInstances, "deliver TEST_Part(Id=a); 72", 0, true, 1,
     "enumInstances(): CMPI_RC_OK"},
    {ENUM, Call::EnumerateInstances, "-1", 0, true, 0, "enumInstances(): CMPI_RC_OK"},

    {CREATE, Call::CreateInstance, "0", 0, true, 1, "createInstance(): CMPI_RC_OK"},
    {CREATE, Call::CreateInstance, "80", 11, false, 0,
     "createInstance(): CMPI_RC_ERR_ALREADY_EXISTS"},
    {CREATE, Call::CreateInstance, "81", 7, false, 0,
     "createInstance(): CMPI_RC_ERR_NOT_SUPPORTED"},
    {CREATE, Call::CreateInstance, "82", 4, false, 0,
     "createInstance(): CMPI_RC_ERR_INVALID_PARAMETER"},
    {CREATE, Call::CreateInstance, "83", 2, false, 0,
     "createInstance(): CMPI_RC_ERR_ACCESS_DENIED"},
    {CREATE, Call::CreateInstance, "84", 1, false, 0, "createInstance(): CMPI_RC_ERR_FAILED"},
    {CREATE, Call::CreateInstance, "85", 0, false, 0, "createInstance(): CMPI_RC_OK"},
    {CREATE, Call::CreateInstance, "-1", 0, false, 0, "createInstance(): CMPI_RC_OK"},

    {DELETE, Call::DeleteInstance, "0", 0, true, 0, "deleteInstance(): CMPI_RC_OK"},
    {DELETE, Call::DeleteInstance, "90", 6, false, 0, "deleteInstance(): CMPI_RC_ERR_NOT_FOUND"},
    {DELETE, Call::DeleteInstance, "91", 7, false, 0,
     "deleteInstance(): CMPI_RC_ERR_NOT_SUPPORTED"},
    {DELETE, Call::DeleteInstance, "92", 2, false, 0,
     "deleteInstance(): CMPI_RC_ERR_ACCESS_DENIED"},
    {DELETE, Call::DeleteInstance, "93", 1, false, 0, "deleteInstance(): CMPI_RC_ERR_FAILED"},
    {DELETE, Call::DeleteInstance, "94", 0, true, 0, "deleteInstance(): CMPI_RC_OK"},
    {DELETE, Call::DeleteInstance, "-1", 0, true, 0, "deleteInstance(): CMPI_RC_OK"},

    {MODIFY, Call::ModifyInstance, "0", 0, true, 1, "modifyInstance(): CMPI_RC_OK"},
    {MODIFY, Call::ModifyInstance, "100", 6, false, 0, "modifyInstance(): CMPI_RC_ERR_NOT_FOUND"},
    {MODIFY, Call::ModifyInstance, "101", 7, false, 0,
     "modifyInstance(): CMPI_RC_ERR_NOT_SUPPORTED"},
    {MODIFY, Call::ModifyInstance, "102", 4, false, 0,
     "modifyInstance(): CMPI_RC_ERR_INVALID_PARAMETER"},
    {MODIFY, Call::ModifyInstance, "103", 2, false, 0,
     "modifyInstance(): CMPI_RC_ERR_ACCESS_DENIED"},
    {MODIFY, Call::ModifyInstance, "104", 1, false, 0, "modifyInstance(): CMPI_RC_ERR_FAILED"},
    {MODIFY, Call::ModifyInstance, "105", 0, false, 0, "modifyInstance(): CMPI_RC_OK"},
    {MODIFY, Call::ModifyInstance, "-1", 0, false, 0, "modifyInstance(): CMPI_RC_OK"},
};

TEST_F(Statuses, OfInstanceOperations) {
  for (const Row& row : instance_rows) {
    control->reset();
    Request asked_for = request(row.call, path("TEST_Part", "a"));
    asked_for.instance = object("TEST_Part", {{"Id", Any::string("a")}});
    expect_row(row, asked_for, "TEST_Part");
  }
}

TEST_F(Statuses, OfASearchThroughAnEnumeration) {
  const struct {
    const char* steps;
    int code;
  } rows[] = {{"deliver TEST_Part(Id=b); deliver TEST_Part(Id=a); 0", 0},
              {"deliver TEST_Part(Id=b); 0", 6},
              // A failed search has found nothing, even with a match in hand.
              {"deliver TEST_Part(Id=a); 70", 6},
              {"deliver TEST_Part(Id=a); 71", 6},
              {"deliver TEST_Part(Id=a); 5", 6}};
  for (const auto& row : rows) {
    play("TEST_Part", GET, "61");
    play("TEST_Part", ENUM, row.steps);
    const Reply reply = run(request(Call::GetInstance, path("TEST_Part", "a")));
    EXPECT_EQ(reply.status.rc, row.code) << row.steps;
    EXPECT_EQ(reply.instances.size(), row.code == 0 ? 1U : 0U) << row.steps;
    EXPECT_EQ(reply.done, row.code == 0) << row.steps;
    EXPECT_EQ(texts("DBG").size(), lines.size());
  }
  // Behind the match nothing more is wanted.
  play("TEST_Part", ENUM, "deliver TEST_Part(Id=a); deliver TEST_Part(Id=a)");
  run(request(Call::GetInstance, path("TEST_Part", "a")));
  EXPECT_EQ(std::vector<std::string>(asked.end() - 2, asked.end()),
            (std::vector<std::string>{"no more", "no more"}));
}

TEST_F(Statuses, OfAnInstanceThatIsNotThereAfterAll) {
  play("TEST_Part", GET, "0");
  const Reply reply = run(request(Call::GetInstance, path("TEST_Part", "a")));
  EXPECT_EQ(reply.status.rc, CMPI_RC_ERR_FAILED);
  EXPECT_EQ(ending(), "getInstance(): CMPI_RC_ERR_FAILED");
  EXPECT_THAT(texts("WARN"), ElementsAre("ignored null instance arg"));
}

// ---- Methods

const Row method_rows[] = {
    {INVOKE, Call::InvokeMethod, "set return_value=7; 0", 0, true, 0, "invokeMethod(): CMPI_RC_OK"},
    {INVOKE, Call::InvokeMethod, "130", 1, false, 0, "invokeMethod(): CMPI_RC_ERR_FAILED"},
    {INVOKE, Call::InvokeMethod, "131", 7, false, 0, "invokeMethod(): CMPI_RC_ERR_NOT_SUPPORTED"},
    {INVOKE, Call::InvokeMethod, "132", 2, false, 0, "invokeMethod(): CMPI_RC_ERR_ACCESS_DENIED"},
    {INVOKE, Call::InvokeMethod, "133", 0, true, 0, "invokeMethod(): CMPI_RC_OK"},
    {INVOKE, Call::InvokeMethod, "-1", 0, true, 0, "invokeMethod(): CMPI_RC_OK"},
};

TEST_F(Statuses, OfMethods) {
  for (const Row& row : method_rows) {
    Request asked_for = request(row.call, path("TEST_All", "x"));
    asked_for.method = "Run";
    expect_row(row, asked_for, "TEST_All");
  }
}

TEST_F(Statuses, OfMethodsThatAreNotCalled) {
  const struct {
    const char* class_name;
    const char* method;
    int code;
    const char* ending;
  } rows[] = {
      {"TEST_All", "Jump", CMPI_RC_ERR_METHOD_NOT_FOUND,
       "invokeMethod(): CMPI_RC_ERR_METHOD_NOT_FOUND Jump"},
      {"TEST_All", "Id", CMPI_RC_ERR_METHOD_NOT_FOUND,
       "invokeMethod(): CMPI_RC_ERR_METHOD_NOT_FOUND Id"},
      {"TEST_All", "", CMPI_RC_ERR_METHOD_NOT_FOUND,
       "invokeMethod(): CMPI_RC_ERR_METHOD_NOT_FOUND "},
      {"TEST_Odd", "test_odd", CMPI_RC_ERR_INVALID_CLASS,
       "invokeMethod(): CMPI_RC_ERR_INVALID_CLASS"},
  };
  for (const auto& row : rows) {
    Request asked_for = request(Call::InvokeMethod, path(row.class_name, "x"));
    asked_for.method = row.method;
    EXPECT_EQ(run(asked_for).status.rc, row.code) << row.method;
    EXPECT_EQ(ending(), row.ending);
    EXPECT_EQ(control->count(row.class_name, INVOKE), 0U);
  }
}

// ---- Associations

const Row walk_rows[] = {
    {REFERENCES, Call::References, "0", 0, false, 0, "references(): CMPI_RC_OK"},
    {REFERENCES, Call::References, "120", 1, false, 0, "references(): CMPI_RC_ERR_FAILED"},
    {REFERENCES, Call::References, "121", 0, false, 1, "references(): CMPI_RC_OK"},
    {REFERENCES, Call::References, "122", 2, false, 0, "references(): CMPI_RC_ERR_ACCESS_DENIED"},
    {REFERENCES, Call::References, "123", 0, false, 1, "references(): CMPI_RC_OK"},
    {REFERENCES, Call::References, "-1", 0, false, 1, "references(): CMPI_RC_OK"},
    {REFERENCES, Call::ReferenceNames, "0", 0, false, 0, "referenceNames(): CMPI_RC_OK"},
    {REFERENCES, Call::ReferenceNames, "120", 1, false, 0, "referenceNames(): CMPI_RC_ERR_FAILED"},
    {REFERENCES, Call::ReferenceNames, "121", 0, false, 1, "referenceNames(): CMPI_RC_OK"},
    {REFERENCES, Call::ReferenceNames, "122", 2, false, 0,
     "referenceNames(): CMPI_RC_ERR_ACCESS_DENIED"},
    {REFERENCES, Call::ReferenceNames, "-1", 0, false, 1, "referenceNames(): CMPI_RC_OK"},

    {NAMES, Call::AssociatorNames, "0", 0, false, 0, "associatorNames(): CMPI_RC_OK"},
    {NAMES, Call::AssociatorNames, "110", 1, false, 0, "associatorNames(): CMPI_RC_ERR_FAILED"},
    {NAMES, Call::AssociatorNames, "111", 0, false, 1, "associatorNames(): CMPI_RC_OK"},
    // Here, and only here, a denied access looks like any failure.
    {NAMES, Call::AssociatorNames, "112", 1, false, 0, "associatorNames(): CMPI_RC_ERR_FAILED"},
    {NAMES, Call::AssociatorNames, "113", 0, false, 1, "associatorNames(): CMPI_RC_OK"},
    {NAMES, Call::AssociatorNames, "-1", 0, false, 1, "associatorNames(): CMPI_RC_OK"},

    {ASSOCIATORS, Call::Associators, "deliver root/test:TEST_Part(Id=own); 0", 0, false, 1,
     "associators(): CMPI_RC_OK"},
    {ASSOCIATORS, Call::Associators, "170", 1, false, 0, "associators(): CMPI_RC_ERR_FAILED"},
    {ASSOCIATORS, Call::Associators, "171", 0, false, 1, "associators(): CMPI_RC_OK"},
    {ASSOCIATORS, Call::Associators, "172", 2, false, 0,
     "associators(): CMPI_RC_ERR_ACCESS_DENIED"},
    {ASSOCIATORS, Call::Associators, "173", 0, false, 1, "associators(): CMPI_RC_OK"},
    {ASSOCIATORS, Call::Associators, "-1", 0, false, 1, "associators(): CMPI_RC_OK"},
    // It falls back to the walk, which asks for the names first.
    {NAMES, Call::Associators, "110", 1, false, 0, "associators(): CMPI_RC_ERR_FAILED"},
    {NAMES, Call::Associators, "112", 1, false, 0, "associators(): CMPI_RC_ERR_FAILED"},
    {NAMES, Call::Associators, "0", 0, false, 0, "associators(): CMPI_RC_OK"},
};

class Walk_Statuses : public Statuses {
 protected:
  /// One link, and the part at its end; whatever a status leads to must come from there.
  void serve_link(const char* steps = "") {
    play(
        "TEST_Link", ENUM,
        std::string("deliver TEST_Link(Antecedent=TEST_Element(Id=e), Dependent=TEST_Part(Id=p))") +
            steps);
    play("TEST_Part", GET, "out TEST_Part(Id=p)");
  }
  /// The lines about the request itself, without those of the up-call inside it.
  void drop_inner_lines() {
    std::erase_if(lines, [](const Log_Line& line) {
      return line.text.find("getInstance()") != std::string::npos;
    });
  }
};

TEST_F(Walk_Statuses, OfAssociations) {
  for (const Row& row : walk_rows) {
    control->reset();
    serve_link();
    play("TEST_Link", row.operation, row.steps);
    const Reply reply = run(request(row.call, path("TEST_Element", "e")));
    const std::string name = std::string(operationName(row.call)) + ": " + row.steps;
    EXPECT_EQ(reply.status.rc, row.code) << name;
    EXPECT_EQ(reply.done, row.done) << name;
    EXPECT_EQ(reply.instances.size() + reply.paths.size(), row.results) << name;
    EXPECT_EQ(ending(), row.ending) << name;
  }
}

TEST_F(Walk_Statuses, OfTheEnumerationBehindAWalk) {
  const struct {
    const char* status;
    int code;
    const char* name;
  } rows[] = {{"; 70", 1, "CMPI_RC_ERR_FAILED"},
              {"; 71", 2, "CMPI_RC_ERR_ACCESS_DENIED"},
              {"; 72", 0, "CMPI_RC_OK"},
              {"; -1", 0, "CMPI_RC_OK"}};
  const std::pair<Call, const char*> calls[] = {{Call::Associators, "associators"},
                                                {Call::AssociatorNames, "associatorNames"},
                                                {Call::References, "references"},
                                                {Call::ReferenceNames, "referenceNames"}};
  for (const auto& row : rows)
    for (const auto& [call, name] : calls) {
      serve_link(row.status);
      const Reply reply = run(request(call, path("TEST_Element", "e")));
      EXPECT_EQ(reply.status.rc, row.code) << name << row.status;
      EXPECT_EQ(reply.instances.size() + reply.paths.size(), 1U) << name << row.status;
      EXPECT_EQ(ending(), std::string(name) + "(): " + row.name);
      drop_inner_lines();
      EXPECT_THAT(texts("DBG"), ElementsAre("enter: " + std::string(name) + "()",
                                            "return: " + std::string(name) + "(): " + row.name));
    }
}

// ---- Queries, and statuses without a message

TEST_F(Statuses, OfQueries) {
  Request asked_for = request(Call::ExecQuery, path("TEST_Part", "a"));
  asked_for.query = "select * from TEST_Part";
  asked_for.language = "WQL";
  EXPECT_EQ(run(asked_for).status.rc, CMPI_RC_ERR_NOT_SUPPORTED);
  EXPECT_THAT(lines,
              ElementsAre(Log_Line{"DBG", "enter: execQuery()"},
                          Log_Line{"DBG", "return: execQuery(): CMPI_RC_ERR_NOT_SUPPORTED"}));
  EXPECT_THAT(asked, IsEmpty());
}

TEST_F(Statuses, CarryNoMessage) {
  for (const char* steps : {"0", "70", "71", "break int"}) {
    play("TEST_Part", ENUM, steps);
    auto* face =
        static_cast<CMPIInstanceMI*>(broker.interface("TEST_Part", InterfaceKind::Instance));
    Straight_Call call(broker);
    const CMPIObjectPath* target = call.path({"", NAME_SPACE, "TEST_Part", {}});
    CMPIStatus status = face->ft->enumerateInstances(face, call.context, call.result, target, {});
    EXPECT_EQ(status.msg, nullptr) << steps;
    status = face->ft->enumerateInstanceNames(face, call.context, call.result, target);
    EXPECT_EQ(status.msg, nullptr) << steps;
    status = face->ft->getInstance(face, call.context, call.result, target, nullptr);
    EXPECT_EQ(status.msg, nullptr) << steps;
  }
}

}  // namespace
}  // namespace cimrt::test
