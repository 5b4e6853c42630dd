// Instances of classes that other providers of the server serve, for up-calls to find.
#pragma once

#include <map>
#include <mutex>
#include <optional>
#include <string>
#include <vector>

#include "Broker.h"

namespace tvx::host {

/// Reads JSON of this form; every part but "version" may be absent:
///
///   {"version": 1,
///    "namespaces": ["root/ibmse"],
///    "instances": [{"class": "IBMSD_ComputerSystem", "namespace": "root/ibmse",
///                   "keys": ["CreationClassName", "Name"],
///                   "properties": {"Name": "host", "Dedicated": [0],
///                                  "Private": {"type": "uint16", "value": 3}}}],
///    "methods": [{"class": "X", "method": "Start", "return": {"type": "uint32", "value": 0},
///                 "out": {"Job": {"type": "string", "value": "1"}}}],
///    "failures": [{"class": "X", "operation": "enumerateInstances", "rc": 1, "message": "down"}]}
///
/// Types come from the class descriptions where the class is known. All functions may be called
/// from several threads.
class ForeignStore {
 public:
  explicit ForeignStore(const BrokerOptions& options) : m_Options(options) {}

  /// Adds what the text says. Throws std::runtime_error with the fault; nothing is added then.
  void add(const std::string& json);

  /// True if instances, methods or failures of that very class are in the store, or were.
  bool knowsClass(const std::string& className) const;
  bool knowsNameSpace(const std::string& nameSpace) const;
  /// Classes of the store that are `base` or derive from it.
  std::vector<std::string> classesBelow(const std::string& base) const;
  /// Those of them ("" for all) that associate: an instance of theirs refers to two objects.
  std::vector<std::string> associationsBelow(const std::string& base) const;
  std::vector<Instance> instances(const std::string& className) const;

  /// Answers a request for the one class of its path. Walks go over the one class that
  /// `assocClass` (for references `resultClass`) names; the instances that `Associators` asks for
  /// are answered as paths, since they may be anybody's.
  Reply answer(const Request& request);

 private:
  struct Method {
    std::string className;
    std::string name;
    Value returnValue;
    NamedValues outputs;
  };
  struct Failure {
    std::string className;
    std::string operation;
    Status status;
  };

  // The following need m_Mutex held.
  const Failure* failureOf(const Request& request) const;
  std::size_t indexOf(const ObjectPath& path) const;
  Status enumerate(const Request& request, Reply& reply) const;
  Status get(const Request& request, Reply& reply) const;
  Status create(const Request& request, Reply& reply);
  Status modify(const Request& request);
  Status remove(const Request& request);
  Status invoke(const Request& request, Reply& reply) const;
  Status walk(const Request& request, Reply& reply) const;
  bool isBelow(const std::string& name, const std::string& base) const;
  bool farEnds(const Instance& link, const Request& request, std::vector<ObjectPath>& ends) const;

  const BrokerOptions& m_Options;
  mutable std::mutex m_Mutex;
  // Guarded by m_Mutex:
  std::vector<Instance> m_Instances;
  std::vector<Method> m_Methods;
  std::vector<Failure> m_Failures;
  std::vector<std::string> m_Classes;
  std::vector<std::string> m_NameSpaces;
};

}  // namespace tvx::host
