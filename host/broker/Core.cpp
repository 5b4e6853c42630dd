#include "broker/Core.h"

#include <fmt/format.h>

#include <cstdio>
#include <cstdlib>

#include "broker/Attachment.h"

namespace tvx::host {
namespace {

/// Shells kept in strict mode to recognise later use; older ones are freed.
constexpr std::size_t graveyardLimit = 65536;

}  // namespace

Core::Core(const BrokerOptions& options, UpCallTarget& target)
    : m_Options(options),
      m_Target(target),
      m_Tables(*this, options.version),
      m_Permanent(*this, "no request") {}

Core::~Core() {
  m_Attachments.clear();
  m_Permanent.end();
}

Scope& Core::owner() {
  Scope* scope = currentScope(*this);
  return scope == nullptr ? m_Permanent : *scope;
}

void Core::adoptObject(Tracked* object, Origin origin) {
  if (origin == Origin::Cloned) {
    owner().countClone(object->kind(), false);
    m_Permanent.adopt(object, origin);
  } else {
    owner().adopt(object, origin);
  }
}

CMPIStatus Core::release(Tracked* object) {
  Life expected = Life::Alive;
  if (!object->m_Life.compare_exchange_strong(expected, Life::Released)) {
    const std::string what =
        fmt::format("{} made by \"{}\"", kindName(object->kind()), object->request());
    if (expected == Life::Released) {
      die("double release of a " + what);
    }
    noteLate(what + " was released after the end of its request");
    return CMPIStatus{CMPI_RC_ERR_INVALID_HANDLE, nullptr};
  }
  if (object->origin() == Origin::Cloned) {
    owner().countClone(object->kind(), true);
  } else if (object->m_Thread != std::this_thread::get_id()) {
    noteLate(fmt::format("{} made by \"{}\" was released on another thread",
                         kindName(object->kind()), object->request()));
  }
  object->m_Scope->remove(object);
  bury(object, Life::Released);
  return CMPIStatus{CMPI_RC_OK, nullptr};
}

void Core::bury(Tracked* object, Life life) {
  std::unique_ptr<Tracked> body(object);
  if (!m_Options.strict) {
    return;
  }
  object->m_Life.store(life, std::memory_order_release);
  object->wipe();
  std::unique_ptr<Tracked> oldest;
  const std::lock_guard lock(m_Mutex);
  m_Graveyard.push_back(std::move(body));
  if (m_Graveyard.size() > graveyardLimit) {
    oldest = std::move(m_Graveyard.front());
    m_Graveyard.pop_front();
  }
}

Tracked* Core::check(void* handle, ObjectKind kind, const char* function) {
  auto* object = static_cast<Tracked*>(handle);
  if (object->kind() != kind) {
    const std::string what = fmt::format("{}: a {} was passed where a {} is expected", function,
                                         kindName(object->kind()), kindName(kind));
    if (m_Options.strict) {
      die(what);
    }
    return nullptr;
  }
  if (m_Options.strict && object->life() != Life::Alive) {
    die(fmt::format("{}: use of a {} made by \"{}\" after {}", function, kindName(kind),
                    object->request(),
                    object->life() == Life::Released ? "its release" : "the end of its request"));
  }
  return object;
}

void Core::die(const std::string& what) {
  std::fprintf(stderr, "broker: %s\n", what.c_str());
  std::fflush(stderr);
  std::abort();
}

void Core::noteLate(std::string text) {
  const std::lock_guard lock(m_Mutex);
  m_LateNotes.push_back(std::move(text));
}

std::vector<std::string> Core::lateNotes() const {
  const std::lock_guard lock(m_Mutex);
  return m_LateNotes;
}

void Core::log(std::string line) {
  const std::lock_guard lock(m_Mutex);
  m_LogLines.push_back(std::move(line));
}

std::vector<std::string> Core::logLines() const {
  const std::lock_guard lock(m_Mutex);
  return m_LogLines;
}

}  // namespace tvx::host
