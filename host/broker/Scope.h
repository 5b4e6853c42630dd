// Ownership of broker objects by requests and attached threads, and the accounts of each.
#pragma once

#include <array>
#include <memory>
#include <mutex>
#include <string>
#include <vector>

#include "broker/Tracked.h"

namespace tvx::host {

/// Counts by kind of object.
using KindCounts = std::array<std::uint64_t, objectKindCount>;

/// What happened to the objects of one request. Filled in every mode; `complaints` only in strict
/// mode.
struct ScopeReport {
  std::string label;       ///< "enumerateInstances TVXHBA_FCPort"
  KindCounts created{};    ///< by the new functions
  KindCounts handedOut{};  ///< by get functions and as arguments
  KindCounts cloned{};
  KindCounts released{};           ///< by the provider, of all origins
  KindCounts leftBehind{};         ///< created and never released: reclaimed at the end
  KindCounts leakedClones{};       ///< cloned here and not released when the request ended
  std::uint64_t leakedBlocks = 0;  ///< memory of cmpiMalloc and its like, not freed at the end
  std::vector<std::string> complaints;

  std::uint64_t count(const KindCounts& counts) const;
  /// True if the provider kept something that a real server would never get back.
  bool leaks() const { return count(leakedClones) != 0 || leakedBlocks != 0; }
  /// One line a kind for a person, empty if nothing was left behind or leaked.
  std::string text() const;
};

/// Owner of the objects of one request, of one attached thread, or of no request at all. Objects
/// may be added and released by several threads.
class Scope {
 public:
  Scope(Core& core, std::string label);
  ~Scope();
  Scope(const Scope&) = delete;
  Scope& operator=(const Scope&) = delete;

  /// Takes over an object.
  void adopt(Tracked* object, Origin origin);
  /// Gives up an object that the provider releases.
  void remove(Tracked* object);
  /// Notes a use of the interface that a provider should not make.
  void complain(std::string text);
  void countBlock(int change);
  /// Counts a clone, which another scope owns, or the release of one.
  void countClone(ObjectKind kind, bool released);

  /// Reclaims everything and answers the accounts; the second call answers the same.
  ScopeReport end();
  /// The accounts so far.
  ScopeReport report();

  Core& core() const { return m_Core; }
  const std::string& label() const { return *m_Label; }

 private:
  Core& m_Core;
  std::shared_ptr<const std::string> m_Label;
  std::mutex m_Mutex;
  // Guarded by m_Mutex:
  Tracked* m_First = nullptr;
  ScopeReport m_Report;
  KindCounts m_OpenClones{};
  std::int64_t m_Blocks = 0;
};

/// Makes `scope` the owner of objects that the calling thread makes, until destroyed.
class ScopeGuard {
 public:
  explicit ScopeGuard(Scope& scope);
  ~ScopeGuard();
  ScopeGuard(const ScopeGuard&) = delete;
  ScopeGuard& operator=(const ScopeGuard&) = delete;

 private:
  Scope& m_Scope;
};

/// Pushes and removes scopes of the calling thread by hand, for attach and detach.
void pushScope(Scope& scope);
/// False if the thread does not have that scope.
bool popScope(Scope& scope);
/// Innermost scope of the calling thread that belongs to `core`, or null.
Scope* currentScope(const Core& core);

}  // namespace tvx::host
