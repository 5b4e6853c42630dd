// What every object of the broker has in common: its kind, its state and the scope that owns it.
#pragma once

#include <atomic>
#include <cstdint>
#include <memory>
#include <string>
#include <thread>

namespace tvx::host {

class Core;
class Scope;

enum class ObjectKind : std::uint8_t {
  Instance,
  ObjectPath,
  Args,
  String,
  Array,
  DateTime,
  Enumeration,
  Context,
  Result,
  SelectExp,
};
inline constexpr std::size_t objectKindCount = 10;

/// "CMPIInstance" and so on.
const char* kindName(ObjectKind kind);

/// How an object came to be, which decides who has to release it.
enum class Origin : std::uint8_t {
  Created,    ///< by one of the new functions; may be released, else the request's end does it
  HandedOut,  ///< by a get function or as a request's argument; the same
  Cloned,     ///< by a clone function; belongs to the provider until it is released
};

enum class Life : std::uint8_t {
  Alive,
  Released,  ///< by the provider
  Expired,   ///< reclaimed when its request ended
};

/// Base of all objects. The `hdl` of the CMPI object points to this base.
class Tracked {
 public:
  Tracked(Core& core, ObjectKind kind) : m_Core(core), m_Kind(kind) {}
  virtual ~Tracked() = default;
  Tracked(const Tracked&) = delete;
  Tracked& operator=(const Tracked&) = delete;

  Core& core() const { return m_Core; }
  ObjectKind kind() const { return m_Kind; }
  Origin origin() const { return m_Origin; }
  Life life() const { return m_Life.load(std::memory_order_acquire); }
  /// Label of the request that made the object.
  const std::string& request() const { return *m_Request; }

 protected:
  /// Frees the contents of a dead object whose shell is kept to recognise later use.
  virtual void wipe() {}

 private:
  friend class Scope;
  friend class Core;

  Core& m_Core;
  const ObjectKind m_Kind;
  Origin m_Origin = Origin::Created;
  std::atomic<Life> m_Life{Life::Alive};
  std::shared_ptr<const std::string> m_Request;
  const std::thread::id m_Thread = std::this_thread::get_id();  ///< that made the object
  Scope* m_Scope = nullptr;                                     ///< guarded by the scope's mutex
  Tracked* m_Next = nullptr;                                    ///< the same
  Tracked* m_Previous = nullptr;                                ///< the same
};

}  // namespace tvx::host
