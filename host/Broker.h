// A small CIM server in a library: it loads a CMPI provider library through its factories and
// sends it requests, in the same process.
//
//   tvx::host::ClassCatalogue classes(tvx::host::allClasses, tvx::host::allClassCount);
//   tvx::host::BrokerOptions options;
//   options.classes = &classes;
//   options.strict = true;
//   tvx::host::Broker broker(options);
//   broker.load("libtorvex_fc_provider.so");            // throws LoadError
//   tvx::host::Reply reply = broker.enumerateInstances("TVXHBA_FCPort");
//   EXPECT_EQ(reply.status.rc, CMPI_RC_OK);
//   EXPECT_EQ(reply.instances.at(0).property("PortType").asUnsigned(), 10u);
//   EXPECT_FALSE(reply.report.leaks()) << reply.report.text();
//
// Conventions:
//  1. Requests may run on any number of threads at once. Loading, unloading and `cleanup` must not
//     run while requests are under way, except that `cleanup` with `terminating` set may.
//  2. Paths are given as objects or as text (`parsePath`); a path without namespace takes that of
//     its class, else `BrokerOptions::nameSpace`.
//  3. Every object that a request makes is reclaimed when it ends; `Reply` holds plain C++ copies.
//  4. A provider's error is an answer (`Reply::status`), never an exception.
#pragma once

#include <filesystem>
#include <functional>
#include <memory>
#include <optional>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

#include "broker/Scope.h"
#include "cim/ClassCatalogue.h"
#include "cim/PathText.h"
#include "cim/TypeNames.h"
#include "cim/Value.h"
#include "cmpi/cmpift.h"

namespace tvx::host {

/// A library that cannot be opened, or that lacks what was asked of it.
class LoadError : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
};

/// The types in which integer keys reach a provider; keys of references alike.
enum class KeyForm {
  OfVersion,   ///< sint64, or for version 0 uint64 unless negative
  Declared,    ///< the type that the class declares, or that the client wrote
  Unsigned64,  ///< uint64, sint64 if negative
  Signed64,    ///< sint64
  Text,        ///< strings; booleans as well
};

struct BrokerOptions {
  /// 200 has every table; 100 has the tables of the first version and no memory table; 0 calls its
  /// tables version 1, has no memory table and no thread control, hands out keys as uint64 or
  /// sint64, string objects without text for a missing namespace or host, and no
  /// CMPIInitNameSpace entry.
  int version = 200;
  /// Accounts for every object by name: aborts on a double release or the use of a dead object,
  /// and collects complaints in the reports.
  bool strict = false;
  /// Descriptions of the classes, or null if none are known: then nothing is checked against them,
  /// and requests reach exactly the class that they name. Must outlive the broker.
  const ClassCatalogue* classes = nullptr;
  std::string nameSpace = "root/torvex";
  /// Namespaces that exist besides those of the classes and of the foreign instances.
  std::vector<std::string> moreNameSpaces = {"root/pg_interop"};
  /// Text of the context entry CMPIPrincipal; nothing makes a string object without text.
  std::optional<std::string> user = "root";
  KeyForm keys = KeyForm::OfVersion;
  /// False leaves the paths of requests without a namespace: a string object without text.
  bool tellsNameSpace = true;
  /// False makes attaching a thread do nothing, as some servers have it: up-calls then work on any
  /// thread, and what such a thread makes is reclaimed with the broker.
  bool attaches = true;
};

/// Null-terminated lists are "nothing" for "all properties".
using PropertyList = std::optional<std::vector<std::string>>;

enum class Operation {
  EnumerateInstanceNames,
  EnumerateInstances,
  GetInstance,
  CreateInstance,
  ModifyInstance,
  DeleteInstance,
  ExecQuery,
  Associators,
  AssociatorNames,
  References,
  ReferenceNames,
  InvokeMethod,
};

/// "enumerateInstanceNames" and so on.
const char* operationName(Operation operation);

/// Everything that a request can say; each operation looks at its own members.
struct Request {
  Operation operation = Operation::EnumerateInstances;
  ObjectPath path;
  PropertyList properties;
  Instance instance;        ///< create, modify
  std::string assocClass;   ///< associators and their names: "" for every association class
  std::string resultClass;  ///< references: the association class
  std::string role;
  std::string resultRole;
  std::string method;
  NamedValues arguments;
  std::string query;
  std::string language;
  /// Request to the one provider of `path`'s class (associations: of `assocClass`, or of
  /// `resultClass` for references) with the class name as it stands; no search through subclasses.
  bool exact = false;
  /// If set, gets each instance as the provider returns it, on the provider's thread, and the reply
  /// keeps none: servers stream large answers so. The instance is the taker's for the call only.
  std::function<void(const Instance&)> takeInstance;
};

struct Status {
  int rc = CMPI_RC_OK;
  std::string message;

  bool ok() const { return rc == CMPI_RC_OK; }
};

/// Answer to a request.
struct Reply {
  Status status;
  std::vector<Instance> instances;
  std::vector<ObjectPath> paths;
  Value returnValue;        ///< of a method
  NamedValues outputs;      ///< of a method
  bool done = false;        ///< the provider called returnDone
  std::vector<Value> data;  ///< values returned otherwise than as method result
  ScopeReport report;       ///< accounts; of the last provider if several were asked
  std::size_t providersAsked = 0;
};

enum class InterfaceKind { Instance, Association, Method };

/// One indication that a provider delivered.
struct Indication {
  std::string nameSpace;
  Instance instance;
};

/// Factories of one provider that is part of the program itself; null members are absent.
struct InProcessProvider {
  CMPIInstanceMI* (*instance)(const CMPIBroker*, const CMPIContext*, CMPIStatus*) = nullptr;
  CMPIAssociationMI* (*association)(const CMPIBroker*, const CMPIContext*, CMPIStatus*) = nullptr;
  CMPIMethodMI* (*method)(const CMPIBroker*, const CMPIContext*, CMPIStatus*) = nullptr;
};

class Broker {
 public:
  explicit Broker(BrokerOptions options = {});
  /// Unloads everything with `terminating` set.
  ~Broker();
  Broker(const Broker&) = delete;
  Broker& operator=(const Broker&) = delete;

  // ---- Providers ----

  /// Opens a provider library (RTLD_NOW, RTLD_LOCAL). Its factories are looked up on first need,
  /// as `<Class>_Provider_Create_<Kind>MI` or `<Class>_Create_<Kind>MI`. Throws LoadError.
  void load(const std::filesystem::path& library);
  bool isLoaded() const;
  /// Registers a class that the program serves itself.
  void addProvider(const std::string& className, const InProcessProvider& provider);
  /// True if the provider library (or an added provider) has the factory.
  bool hasInterface(const std::string& className, InterfaceKind kind);
  /// The interface, made by its factory if need be, for calls past the broker; null if there is
  /// no factory.
  void* interface(const std::string& className, InterfaceKind kind);

  /// Calls `cleanup` of one interface that exists; forgets it if the answer is OK.
  Status cleanup(const std::string& className, InterfaceKind kind, bool terminating);
  /// Calls `cleanup` of every interface. If all agree, closes the library and answers OK; else
  /// answers the first refusal and keeps the library with the interfaces that refused.
  Status unload(bool terminating = false);
  /// What a server does that takes a library's interfaces of one kind for one: calls `cleanup` of a
  /// single interface of each kind, whatever their number, and forgets them all. The library stays.
  Status cleanupOncePerKind(bool terminating);
  /// True if the library stayed mapped after its last close (static thread data can keep it).
  bool stillMapped(const std::filesystem::path& library) const;

  /// Table of the broker, for tests that call it as a provider would.
  const CMPIBroker* face() const;

  // ---- Requests ----

  Reply run(const Request& request);

  Reply enumerateInstanceNames(std::string_view className);
  Reply enumerateInstances(std::string_view className, const PropertyList& properties = {});
  Reply getInstance(const ObjectPath& path, const PropertyList& properties = {});
  Reply createInstance(const Instance& instance);
  Reply modifyInstance(const Instance& instance, const PropertyList& properties = {});
  Reply deleteInstance(const ObjectPath& path);
  Reply execQuery(std::string_view className, const std::string& query,
                  const std::string& language);
  Reply associators(const ObjectPath& source, const std::string& assocClass = "",
                    const std::string& resultClass = "", const std::string& role = "",
                    const std::string& resultRole = "", const PropertyList& properties = {});
  Reply associatorNames(const ObjectPath& source, const std::string& assocClass = "",
                        const std::string& resultClass = "", const std::string& role = "",
                        const std::string& resultRole = "");
  Reply references(const ObjectPath& source, const std::string& resultClass = "",
                   const std::string& role = "", const PropertyList& properties = {});
  Reply referenceNames(const ObjectPath& source, const std::string& resultClass = "",
                       const std::string& role = "");
  Reply invokeMethod(const ObjectPath& path, const std::string& method,
                     const NamedValues& arguments = {});

  /// Reads a path text with the broker's default namespace and classes. Throws PathError.
  ObjectPath path(std::string_view text) const;

  // ---- The rest of the server ----

  /// Adds instances of other providers' classes out of JSON text; see ForeignStore.h for its form.
  /// Throws std::runtime_error with the place of the fault.
  void addForeign(const std::string& json);
  void addForeignFile(const std::filesystem::path& file);
  /// What the store holds of one class now.
  std::vector<Instance> foreignInstances(const std::string& className) const;
  std::vector<Indication> indications() const;
  /// Lines that providers sent with logMessage and trace.
  std::vector<std::string> logLines() const;

  // ---- Accounts ----

  /// Objects made outside of any request or attached thread, and clones.
  ScopeReport permanentReport();
  /// One entry for each thread that was attached and detached.
  std::vector<ScopeReport> threadReports() const;
  /// Threads that were prepared and never detached.
  std::size_t openAttachments() const;
  /// Releases and uses that came after the end of their request (strict mode), and releases on
  /// another thread than the object was made on.
  std::vector<std::string> lateNotes() const;

  class Impl;

 private:
  std::unique_ptr<Impl> m_Impl;
};

}  // namespace tvx::host
