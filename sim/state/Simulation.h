// The one simulated host of the process, shared by the libraries.
#pragma once

#include <cstdint>
#include <map>
#include <mutex>
#include <string>
#include <string_view>
#include <utility>

#include "state/Fault.h"
#include "state/World.h"

namespace tvx::sim {

/// Holds the world, and the lock over it. All operations may be called from any thread.
///
/// The scenario comes from the environment variable TVX_SIM_SCENARIO (a path), else it is the
/// built-in one. It is read at first use. A library that is loaded or initialised anew looks
/// whether the variable or the file changed meanwhile and, if so, starts a new world. A scenario
/// that cannot be used gives a world without adapters and one line on standard error.
///
/// With TVX_SIM_STATE (a path) what calls change is kept in that file, and found again by the next
/// process that reads the scenario; for the simulated host that is a reboot.
class Simulation {
 public:
  static Simulation& instance();

  /// Reads the scenario unless the present world was made from the very same file.
  void refresh();

  /// Makes a world of this file (or, with an empty path, of the environment's scenario) and stays
  /// with it until the next call of this kind. Answers an empty text, or what is wrong with it.
  std::string load_file(const std::string& path);
  std::string load_text(const std::string& text);

  /// Counts a call and finds what faults do to it; waits out their delay, without the lock.
  /// Where the site names a local port its adapter is filled in, and the other way round.
  Fault_Effect begin_call(Call_Site site);

  /// Keeps what a successful call changed, when TVX_SIM_STATE names a file. With the lock held,
  /// from within `with_world`.
  void end_call(std::string_view name);

  /// Runs `body` with the world, under the lock, and answers its result.
  template <class Body>
  auto with_world(Body&& body) {
    const std::lock_guard<std::mutex> guard(m_Mutex);
    ensure_world();
    return std::forward<Body>(body)(m_World);
  }

  /// How often an entry point was called, for one local port or (null) in all.
  std::uint64_t calls(const std::string& name, const Wwn* port);
  void forget_calls();

 private:
  Simulation() = default;
  void ensure_world();
  std::string replace_world(const std::string& source, const std::string& text);
  void load_environment();
  void restore_world();

  std::mutex m_Mutex;
  // Guarded by m_Mutex:
  World m_World;
  bool m_bLoaded = false;
  bool m_bPinned = false;
  std::string m_StatePath;  // empty: changes end with the process
  std::string m_Stamp;      // what the world was made from: path, size and time of the file
  std::map<std::string, std::map<Wwn, std::uint64_t>, std::less<>> m_Calls;
};

/// Simulation::refresh for the C boundary: without memory the present world stays.
void refresh_quietly() noexcept;

}  // namespace tvx::sim
