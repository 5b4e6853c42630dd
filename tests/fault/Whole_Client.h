// A client that asks a provider for everything it can: every class, every association, every
// method.
#pragma once

#include <cstddef>
#include <map>
#include <string>
#include <vector>

#include "Broker.h"

namespace tvx::test {

/// What came of a round of requests.
struct Client_Tally {
  std::size_t requests = 0;
  std::size_t instances = 0;
  std::size_t methods = 0;
  std::map<int, std::size_t> byStatus;  ///< requests by CMPI return code
  std::map<int, std::string> examples;  ///< one request of each code
  std::vector<std::string> leaks;       ///< accounts of requests that left something behind
  std::vector<std::string> lost;        ///< requests that succeeded without an end to their answer

  void add(const Client_Tally& other);
};

/// One of the calls that methods are called with: arguments as the command line writes them, where
/// "$Class" stands for the first instance of the class.
struct Method_Call {
  const char* className;
  const char* method;
  std::vector<std::string> arguments;
};

/// Calls that reach as far into each method as a simulated host lets them; `folder` is one that
/// files may be made in.
std::vector<Method_Call> purposefulCalls(const std::string& folder);

/// One client of one broker. The broker's library must be loaded, and strict accounting on for
/// leaks to be seen.
class Whole_Client {
 public:
  Whole_Client(host::Broker& broker, const host::ClassCatalogue& classes, std::string folder);

  /// Names and instances of one class, one instance by its path, and what it is associated with.
  void readClass(const host::ClassData& classData);
  /// The same of every class.
  void readEverything();
  /// The instances of every class.
  void readInstances();
  /// Every method of every class, without arguments; then the purposeful calls.
  void callEverything();
  /// One call. A host that lacks the instances that it is about is not asked.
  void call(const Method_Call& call);
  /// What the client may change otherwise: settings, entries that it makes and removes.
  void changeEverything();

  const Client_Tally& tally() const { return m_Tally; }

 private:
  host::Reply count(host::Reply reply, const std::string& what);
  /// The same of an answer that the provider must end.
  host::Reply countWhole(host::Reply reply, const std::string& what);
  const host::ObjectPath* firstOf(const std::string& className);
  /// Names, instances and one instance by its path, which is answered; null if there is none.
  const host::ObjectPath* readInstancesOf(const host::ClassData& classData);
  /// Every diagnostic test, on the first port, with settings of its own.
  void runTests();
  void callBare(const host::ClassData& classData);
  /// Gives each of the provider's settings another value than the last time.
  void changeSettings();

  host::Broker& m_Broker;
  const host::ClassCatalogue& m_Classes;
  std::string m_Folder;
  std::map<std::string, host::ObjectPath> m_First;
  unsigned m_Changes = 0;
  Client_Tally m_Tally;
};

}  // namespace tvx::test
