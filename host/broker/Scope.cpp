#include "broker/Scope.h"

#include <fmt/format.h>

#include <algorithm>
#include <numeric>

#include "broker/Core.h"

namespace tvx::host {
namespace {

constexpr const char* kindNames[objectKindCount] = {
    "CMPIInstance", "CMPIObjectPath",  "CMPIArgs",    "CMPIString", "CMPIArray",
    "CMPIDateTime", "CMPIEnumeration", "CMPIContext", "CMPIResult", "CMPISelectExp"};

/// The core stands beside its scope so that a scope which outlived its broker is never looked into.
struct ThreadScope {
  const Core* core;
  Scope* scope;
};

std::vector<ThreadScope>& threadScopes() {
  thread_local std::vector<ThreadScope> scopes;
  return scopes;
}

std::size_t index(ObjectKind kind) {
  return static_cast<std::size_t>(kind);
}

}  // namespace

const char* kindName(ObjectKind kind) {
  return kindNames[index(kind)];
}

std::uint64_t ScopeReport::count(const KindCounts& counts) const {
  return std::accumulate(counts.begin(), counts.end(), std::uint64_t{0});
}

std::string ScopeReport::text() const {
  std::string result;
  for (std::size_t i = 0; i < objectKindCount; ++i) {
    if (leftBehind[i] != 0) {
      result += fmt::format("{}: {} {} left to the broker\n", label, leftBehind[i], kindNames[i]);
    }
    if (leakedClones[i] != 0) {
      result += fmt::format("{}: {} cloned {} leaked\n", label, leakedClones[i], kindNames[i]);
    }
  }
  if (leakedBlocks != 0) {
    result += fmt::format("{}: {} memory blocks leaked\n", label, leakedBlocks);
  }
  for (const std::string& complaint : complaints) {
    result += fmt::format("{}: {}\n", label, complaint);
  }
  return result;
}

Scope::Scope(Core& core, std::string label)
    : m_Core(core), m_Label(std::make_shared<const std::string>(std::move(label))) {
  m_Report.label = *m_Label;
}

Scope::~Scope() {
  end();
}

void Scope::adopt(Tracked* object, Origin origin) {
  const std::lock_guard lock(m_Mutex);
  object->m_Origin = origin;
  object->m_Request = m_Label;
  object->m_Scope = this;
  object->m_Next = m_First;
  if (m_First != nullptr) {
    m_First->m_Previous = object;
  }
  m_First = object;
  if (origin == Origin::Created) {
    ++m_Report.created[index(object->kind())];
  } else if (origin == Origin::HandedOut) {
    ++m_Report.handedOut[index(object->kind())];
  }
}

void Scope::remove(Tracked* object) {
  const std::lock_guard lock(m_Mutex);
  (object->m_Previous != nullptr ? object->m_Previous->m_Next : m_First) = object->m_Next;
  if (object->m_Next != nullptr) {
    object->m_Next->m_Previous = object->m_Previous;
  }
  object->m_Next = object->m_Previous = nullptr;
  object->m_Scope = nullptr;
  ++m_Report.released[index(object->kind())];
}

void Scope::complain(std::string text) {
  const std::lock_guard lock(m_Mutex);
  auto& complaints = m_Report.complaints;
  if (std::find(complaints.begin(), complaints.end(), text) == complaints.end()) {
    complaints.push_back(std::move(text));
  }
}

void Scope::countBlock(int change) {
  const std::lock_guard lock(m_Mutex);
  m_Blocks += change;
}

void Scope::countClone(ObjectKind kind, bool released) {
  const std::lock_guard lock(m_Mutex);
  if (!released) {
    ++m_Report.cloned[index(kind)];
    ++m_OpenClones[index(kind)];
  } else if (m_OpenClones[index(kind)] != 0) {
    --m_OpenClones[index(kind)];
  }
}

ScopeReport Scope::end() {
  Tracked* object = nullptr;
  {
    const std::lock_guard lock(m_Mutex);
    object = std::exchange(m_First, nullptr);
    m_Report.leakedClones = m_OpenClones;
    m_Report.leakedBlocks = static_cast<std::uint64_t>(std::max<std::int64_t>(m_Blocks, 0));
    for (Tracked* each = object; each != nullptr; each = each->m_Next) {
      each->m_Scope = nullptr;
      if (each->m_Origin == Origin::Created) {
        ++m_Report.leftBehind[index(each->kind())];
      }
    }
  }
  while (object != nullptr) {
    Tracked* next = std::exchange(object->m_Next, nullptr);
    object->m_Previous = nullptr;
    m_Core.bury(object, Life::Expired);
    object = next;
  }
  const std::lock_guard lock(m_Mutex);
  return m_Report;
}

ScopeReport Scope::report() {
  const std::lock_guard lock(m_Mutex);
  return m_Report;
}

ScopeGuard::ScopeGuard(Scope& scope) : m_Scope(scope) {
  pushScope(scope);
}

ScopeGuard::~ScopeGuard() {
  popScope(m_Scope);
}

void pushScope(Scope& scope) {
  threadScopes().push_back({&scope.core(), &scope});
}

bool popScope(Scope& scope) {
  auto& scopes = threadScopes();
  const auto found = std::find_if(scopes.rbegin(), scopes.rend(),
                                  [&](const ThreadScope& each) { return each.scope == &scope; });
  if (found == scopes.rend()) {
    return false;
  }
  scopes.erase(std::next(found).base());
  return true;
}

Scope* currentScope(const Core& core) {
  const auto& scopes = threadScopes();
  const auto found = std::find_if(scopes.rbegin(), scopes.rend(),
                                  [&](const ThreadScope& each) { return each.core == &core; });
  return found == scopes.rend() ? nullptr : found->scope;
}

}  // namespace tvx::host
