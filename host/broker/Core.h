// The heart of one broker: its options, its function tables, the owners of its objects.
#pragma once

#include <deque>
#include <memory>
#include <mutex>
#include <string>
#include <vector>

#include "Broker.h"
#include "broker/Scope.h"
#include "broker/Tables.h"
#include "broker/Tracked.h"

namespace tvx::host {

class ForeignStore;

/// Answers up-calls; implemented by the broker's router.
class UpCallTarget {
 public:
  virtual ~UpCallTarget() = default;
  virtual Reply upCall(const Request& request) = 0;
  virtual void indication(const std::string& nameSpace, Instance instance) = 0;
};

/// A thread of the provider that is being or was attached.
struct Attachment;

class Core {
 public:
  Core(const BrokerOptions& options, UpCallTarget& target);
  ~Core();
  Core(const Core&) = delete;
  Core& operator=(const Core&) = delete;

  const BrokerOptions& options() const { return m_Options; }
  const Tables& tables() const { return m_Tables; }
  UpCallTarget& target() const { return m_Target; }
  const CMPIBroker* face() const { return m_Tables.broker(); }
  static Core& of(const CMPIBroker* broker) { return *static_cast<Core*>(broker->hdl); }

  /// Owner of what the calling thread makes: its request, or the broker itself outside of any.
  Scope& owner();
  /// Owner of clones and of what is made outside of requests.
  Scope& permanent() { return m_Permanent; }

  /// Gives a new object its owner and answers it.
  template <class T>
  T* adopt(std::unique_ptr<T> object, Origin origin) {
    T* result = object.release();
    adoptObject(result, origin);
    return result;
  }

  /// Release by the provider: frees the object. Aborts in strict mode if it was released before;
  /// a release after the end of its request is noted.
  CMPIStatus release(Tracked* object);
  /// Ends an object that no scope owns any more: frees it, or in strict mode keeps its shell.
  void bury(Tracked* object, Life life);
  /// Checks a handle that the provider passed in: aborts in strict mode if the object is dead or of
  /// another kind. Null handles are answered as null.
  Tracked* check(void* handle, ObjectKind kind, const char* function);
  /// Says what the provider did wrong and aborts.
  [[noreturn]] static void die(const std::string& what);

  /// Notes that something was released or used late, outside of the accounts of its request.
  void noteLate(std::string text);
  std::vector<std::string> lateNotes() const;

  // Attached threads; see UpCalls.cpp.
  CMPIContext* prepareAttach(const CMPIContext* context);
  CMPIStatus attach(const CMPIContext* context);
  CMPIStatus detach(const CMPIContext* context);
  /// Contexts that were prepared and not detached.
  std::size_t openAttachments() const;
  /// Accounts of the threads that were detached.
  std::vector<ScopeReport> threadReports() const;

  void log(std::string line);
  std::vector<std::string> logLines() const;

 private:
  void adoptObject(Tracked* object, Origin origin);

  const BrokerOptions m_Options;
  UpCallTarget& m_Target;
  const Tables m_Tables;
  Scope m_Permanent;

  mutable std::mutex m_Mutex;
  // Guarded by m_Mutex:
  std::deque<std::unique_ptr<Tracked>> m_Graveyard;
  std::vector<std::string> m_LateNotes;
  std::vector<std::unique_ptr<Attachment>> m_Attachments;
  std::vector<ScopeReport> m_ThreadReports;
  std::vector<std::string> m_LogLines;
};

}  // namespace tvx::host
