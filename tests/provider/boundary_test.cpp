// The border between server and library where a request is not alone: requests beside each other
// and inside each other, and allocations that fail inside the library.
#include <atomic>
#include <chrono>
#include <filesystem>
#include <functional>
#include <thread>

#include "Failing_Allocations.h"
#include "Traced_Library.h"
#include "broker/Objects.h"
#include "broker/Scope.h"

namespace tvx::test {
namespace {

using host::Reply;

/// A request made past the broker, whose results go through a hook.
class Hooked_Request {
 public:
  Hooked_Request(host::Broker& broker, const std::string& className)
      : m_Core(host::Core::of(broker.face())),
        m_Interface(static_cast<CMPIInstanceMI*>(
            broker.interface(className, host::InterfaceKind::Instance))),
        m_ClassName(className) {}

  /// Enumerates; `onInstance` runs inside the delivery of each instance.
  int run(const std::function<void()>& onInstance) {
    host::Scope scope(m_Core, "hooked");
    const host::ScopeGuard guard(scope);
    CMPIResult* result = host::makeResult(m_Core, reply);
    CMPIResultFT table = *result->ft;
    hook = &onInstance;
    usual = table.returnInstance;
    table.returnInstance = [](const CMPIResult* face, const CMPIInstance* instance) {
      (*hook)();
      return usual(face, instance);
    };
    result->ft = &table;
    const CMPIObjectPath* path =
        host::makePath(m_Core, {"", "root/torvex", m_ClassName, {}}, host::Origin::HandedOut);
    const CMPIContext* context = host::makeContext(m_Core, {}, host::Origin::HandedOut);
    return m_Interface->ft->enumerateInstances(m_Interface, context, result, path, nullptr).rc;
  }

  Reply reply;

 private:
  using Return = CMPIStatus (*)(const CMPIResult*, const CMPIInstance*);
  static inline thread_local const std::function<void()>* hook = nullptr;
  static inline thread_local Return usual = nullptr;

  host::Core& m_Core;
  CMPIInstanceMI* m_Interface;
  std::string m_ClassName;
};

class Boundary : public Provider_Test {
 protected:
  void SetUp() override {
    Provider_Test::SetUp();
    load();
    instances("TVXHBA_FCPort");
  }
};

TEST_F(Boundary, OneClassIsServedWhileAnotherDelivers) {
  Hooked_Request ports(*broker, "TVXHBA_FCPort");
  std::size_t cards = 0;
  const int code = ports.run([&] {
    // On a thread of its own, as the server does it; the delivery waits for its answer.
    std::thread other([&] { cards += broker->enumerateInstances("TVXHBA_Card").instances.size(); });
    other.join();
  });
  EXPECT_EQ(code, CMPI_RC_OK);
  EXPECT_EQ(ports.reply.instances.size(), 4U);
  EXPECT_EQ(cards, 8U) << "two cards for each of the four ports";
}

TEST_F(Boundary, TheThreadOfARequestMayAskTheSameClassAgain) {
  Hooked_Request ports(*broker, "TVXHBA_FCPort");
  std::size_t inner = 0;
  const int code = ports.run([&] {
    const Reply again = broker->enumerateInstanceNames("TVXHBA_FCPort");
    EXPECT_EQ(again.status.rc, CMPI_RC_OK);
    EXPECT_FALSE(again.report.leaks());
    inner += again.paths.size();
  });
  EXPECT_EQ(code, CMPI_RC_OK);
  EXPECT_EQ(ports.reply.instances.size(), 4U);
  EXPECT_EQ(inner, 16U);
}

TEST_F(Boundary, AClassLetsOneRequestInAtATime) {
  Hooked_Request ports(*broker, "TVXHBA_FCPort");
  std::atomic<bool> done{false};
  std::thread other;
  bool early = false;
  const int code = ports.run([&] {
    if (!other.joinable())
      other = std::thread([&] {
        broker->enumerateInstances("TVXHBA_FCPort");
        done = true;
      });
    std::this_thread::sleep_for(std::chrono::milliseconds(2));
    early = early || done;
  });
  other.join();
  EXPECT_EQ(code, CMPI_RC_OK);
  EXPECT_FALSE(early);
  EXPECT_TRUE(done);
}

/// Hands a class's interface a path of a class that the library does not know.
int enumerateUnknownClass(host::Broker& broker, const std::string& className, bool names) {
  host::Core& core = host::Core::of(broker.face());
  auto* face =
      static_cast<CMPIInstanceMI*>(broker.interface(className, host::InterfaceKind::Instance));
  host::Scope scope(core, "unknown");
  const host::ScopeGuard guard(scope);
  Reply reply;
  const CMPIResult* result = host::makeResult(core, reply);
  const CMPIContext* context = host::makeContext(core, {}, host::Origin::HandedOut);
  const CMPIObjectPath* path =
      host::makePath(core, {"", "root/torvex", "No_Such_Class", {}}, host::Origin::HandedOut);
  const CMPIStatus status =
      names ? face->ft->enumerateInstanceNames(face, context, result, path)
            : face->ft->enumerateInstances(face, context, result, path, nullptr);
  EXPECT_FALSE(reply.done) << className;
  EXPECT_EQ(status.msg, nullptr) << className;
  return status.rc;
}

TEST_F(Boundary, AnUnknownClassFailsInEveryInterface) {
  for (const std::string& name : servedClasses())
    for (const bool names : {false, true})
      EXPECT_EQ(enumerateUnknownClass(*broker, name, names), CMPI_RC_ERR_FAILED) << name;
}

/// What an association's interface answers to a walk with that filter, which may be null.
std::size_t walk(host::Broker& broker, const std::string& association,
                 const host::ObjectPath& source, const char* filter) {
  host::Core& core = host::Core::of(broker.face());
  auto* face = static_cast<CMPIAssociationMI*>(
      broker.interface(association, host::InterfaceKind::Association));
  host::Scope scope(core, "walk");
  const host::ScopeGuard guard(scope);
  Reply reply;
  const CMPIResult* result = host::makeResult(core, reply);
  const CMPIContext* context = host::makeContext(core, {}, host::Origin::HandedOut);
  const CMPIObjectPath* path = host::makePath(core, source, host::Origin::HandedOut);
  const auto& table = *face->ft;
  EXPECT_EQ(table.referenceNames(face, context, result, path, filter, nullptr).rc, CMPI_RC_OK);
  EXPECT_EQ(table.references(face, context, result, path, filter, nullptr, nullptr).rc, CMPI_RC_OK);
  EXPECT_EQ(reply.paths.size(), reply.instances.size()) << association;
  EXPECT_EQ(
      table.associatorNames(face, context, result, path, filter, nullptr, nullptr, nullptr).rc,
      CMPI_RC_OK);
  return reply.paths.size() + reply.instances.size();
}

TEST_F(Boundary, AWalkNeedsNoFilterAndTakesTheClients) {
  // Servers fill in the association's own class, or hand on what the client wrote.
  std::size_t walked = 0;
  for (const std::string& name : servedClasses()) {
    if (!classes->find(name)->isAssociation) continue;
    const std::vector<host::Instance> links = instances(name);
    if (links.empty()) continue;
    for (const host::NamedValue& end : links.front().properties) {
      if (end.value.type() != CMPI_ref) continue;
      const host::ObjectPath& source = end.value.asReference();
      const std::size_t expected = walk(*broker, name, source, name.c_str());
      EXPECT_GE(expected, 3U) << name << "." << end.name;
      for (const char* filter : {static_cast<const char*>(nullptr), "", "CIM_Dependency"})
        EXPECT_EQ(walk(*broker, name, source, filter), expected) << name << "." << end.name;
      ++walked;
    }
  }
  EXPECT_GT(walked, 120U);
}

/// Runs a request again and again, with the first, the second... of the library's allocations
/// failing, until it gets by without one.
void failEveryAllocation(const std::function<Reply()>& request) {
  const int usual = request().status.rc;  // makes the interface as well
  int failures = 0;
  for (long number = 0;; ++number) {
    Allocations::failAfter(number);
    const Reply reply = request();
    const bool failed = Allocations::stop();
    EXPECT_TRUE(reply.status.rc == CMPI_RC_ERR_FAILED || reply.status.rc == CMPI_RC_ERR_NOT_FOUND ||
                reply.status.rc == usual)
        << number << ": " << reply.status.rc;
    EXPECT_FALSE(reply.report.leaks()) << number << reply.report.text();
    if (!failed) break;
    ++failures;
    ASSERT_LT(number, 20000);
  }
  EXPECT_GT(failures, 0) << "nothing was allocated";
}

TEST_F(Boundary, AnAllocationThatFailsEndsTheRequestAndNoMore) {
  ASSERT_TRUE(Allocations::watch(TVX_PROVIDER_LIBRARY));
  const std::vector<host::Instance> before = instances("TVXHBA_FCPort");
  const host::ObjectPath port = before.at(0).path;
  failEveryAllocation([&] { return broker->enumerateInstances("TVXHBA_Card"); });
  failEveryAllocation([&] { return broker->enumerateInstanceNames("TVXHBA_FCPort"); });
  failEveryAllocation([&] { return broker->getInstance(port); });
  failEveryAllocation([&] { return broker->associatorNames(port, "TVXHBA_ControlledBy"); });
  failEveryAllocation([&] { return broker->associators(port, "TVXHBA_ControlledBy"); });
  failEveryAllocation([&] { return broker->references(port, "TVXHBA_ControlledBy"); });
  failEveryAllocation([&] { return broker->modifyInstance(before.at(0)); });
  failEveryAllocation([&] { return broker->invokeMethod(port, "Reset"); });
  EXPECT_EQ(instances("TVXHBA_FCPort").size(), 4U);
  EXPECT_EQ(instances("TVXHBA_Card").size(), 2U);
}

// ---- What the log tells and the server does not hear

using Traced = Traced_Library;

TEST_F(Traced, AnUnknownSourceClassIsAnErrorInTheLogAlone) {
  host::Request request;
  request.exact = true;
  request.path = {"", "root/torvex", "No_Such_Class", {}};
  request.assocClass = request.resultClass = "TVXHBA_ControlledBy";
  EXPECT_EQ(broker->enumerateInstanceNames("TVXHBA_ControlledBy").status.rc, CMPI_RC_OK);
  const std::pair<host::Operation, const char*> rows[] = {
      {host::Operation::Associators, "DBG: return: associators(): CMPI_RC_OK"},
      {host::Operation::AssociatorNames,
       "DBG: return: associatorNames(): CMPI_RC_ERR_INVALID_CLASS"},
      {host::Operation::References, "DBG: return: references(): CMPI_RC_ERR_INVALID_CLASS"},
      {host::Operation::ReferenceNames,
       "DBG: return: referenceNames(): CMPI_RC_ERR_INVALID_CLASS"}};
  for (const auto& [operation, line] : rows) {
    request.operation = operation;
    const auto lines = linesOf([&] { return broker->run(request); }, CMPI_RC_OK);
    ASSERT_FALSE(lines.empty()) << line;
    EXPECT_EQ(lines.back(), line);
    EXPECT_TRUE(last.paths.empty() && last.instances.empty());
  }
}

TEST_F(Traced, EveryOperationTellsItsBeginAndItsEnd) {
  const host::ObjectPath card = broker->enumerateInstanceNames("TVXHBA_Card").paths.at(0);
  host::ObjectPath nobody = card;
  nobody.keys.set("Tag", host::Value::string("nobody"));
  const host::Instance sent{card, {}};
  using Lines = std::vector<std::string>;
  EXPECT_EQ(
      linesOf([&] { return broker->getInstance(nobody); }, CMPI_RC_ERR_NOT_FOUND),
      (Lines{"DBG: enter: getInstance()", "DBG: return: getInstance(): CMPI_RC_ERR_NOT_FOUND"}));
  EXPECT_EQ(linesOf([&] { return broker->createInstance(sent); }, CMPI_RC_ERR_NOT_SUPPORTED),
            (Lines{"DBG: enter: createInstance()",
                   "DBG: return: createInstance(): CMPI_RC_ERR_NOT_SUPPORTED"}));
  EXPECT_EQ(linesOf([&] { return broker->modifyInstance(sent); }, CMPI_RC_ERR_NOT_SUPPORTED),
            (Lines{"DBG: enter: modifyInstance()",
                   "DBG: return: modifyInstance(): CMPI_RC_ERR_NOT_SUPPORTED"}));
  EXPECT_EQ(linesOf([&] { return broker->deleteInstance(card); }, CMPI_RC_ERR_NOT_SUPPORTED),
            (Lines{"DBG: enter: deleteInstance()",
                   "DBG: return: deleteInstance(): CMPI_RC_ERR_NOT_SUPPORTED"}));
  EXPECT_EQ(
      linesOf([&] { return broker->execQuery("TVXHBA_Card", "q", "l"); },
              CMPI_RC_ERR_NOT_SUPPORTED),
      (Lines{"DBG: enter: execQuery()", "DBG: return: execQuery(): CMPI_RC_ERR_NOT_SUPPORTED"}));
  broker->invokeMethod(card, "IsCompatible");
  EXPECT_EQ(
      linesOf([&] { return broker->invokeMethod(card, "Fly"); }, CMPI_RC_ERR_METHOD_NOT_FOUND),
      (Lines{"DBG: enter: invokeMethod()",
             "DBG: return: invokeMethod(): CMPI_RC_ERR_METHOD_NOT_FOUND Fly"}));
}

std::size_t openFiles() {
  const std::filesystem::directory_iterator files("/proc/self/fd");
  return static_cast<std::size_t>(std::distance(begin(files), end(files)));
}

TEST_F(Traced, TheLogIsClosedWhenTheLibraryGoes) {
  const auto serve = [&] {
    instances("TVXHBA_Card");
    unload();
  };
  serve();
  const std::size_t before = openFiles();
  for (int life = 0; life < 3; ++life) {
    load();
    serve();
  }
  EXPECT_EQ(openFiles(), before);
  EXPECT_GT(std::filesystem::file_size(root / ".cimrt/messages"), 0U);
}

}  // namespace
}  // namespace tvx::test
