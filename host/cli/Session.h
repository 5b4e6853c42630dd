// One run of the program over one broker: what every command needs.
#pragma once

#include <memory>
#include <mutex>
#include <ostream>
#include <string>

#include "Broker.h"
#include "cli/ExitCode.h"
#include "cli/Options.h"

namespace tvx::host {

/// Loads the library, sends requests, turns failures into CommandErrors and keeps the accounts for
/// strict mode.
class Session {
 public:
  /// Throws CommandError (Library, File).
  Session(const Options& options, const ClassCatalogue& classes, std::ostream& out,
          std::ostream& err);

  const Options& options() const { return m_Options; }
  const ClassCatalogue& classes() const { return m_Classes; }
  std::ostream& out() { return m_Out; }
  std::ostream& err() { return m_Err; }
  /// For commands that answer requests of others; their accounts come back through `keep`.
  Broker& broker() { return *m_Broker; }
  /// Keeps accounts that show a leak until the end. Safe on many threads at once.
  void keep(const ScopeReport& report);

  /// The class, or CommandError (UnknownClass) with near names. A class of the --foreign store
  /// that has no description is let through as null.
  const ClassData* requireClass(const std::string& name);
  /// Runs a request. Throws CommandError for a failure unless `partial` is set, which keeps it in
  /// the reply.
  Reply run(Request request, bool partial = false);
  /// Throws what `run` would for this status, made out by the operation and the thing asked for.
  [[noreturn]] void fail(const Status& status, const std::string& what) const;

  /// Reads a path and completes it: keys that are left out are looked up among the instances of
  /// its class. Throws CommandError (NotFound) if none or more than one fits.
  ObjectPath resolve(const std::string& text);

  /// Unloads the library and prints strict mode's findings. Answers Strict if something leaked.
  ExitCode finish();

 private:
  ObjectPath complete(ObjectPath path, const ClassData& classData);

  const Options& m_Options;
  const ClassCatalogue& m_Classes;
  std::ostream& m_Out;
  std::ostream& m_Err;
  std::unique_ptr<Broker> m_Broker;
  std::mutex m_Mutex;
  std::vector<ScopeReport> m_Reports;  ///< guarded by m_Mutex while `keep` is in use
};

/// `name` with near names behind it: "unknown class 'X'; did you mean Y, Z?".
std::string unknownClassText(const ClassCatalogue& classes, const std::string& name);

}  // namespace tvx::host
