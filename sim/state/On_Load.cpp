// What happens while one of the simulated libraries is being loaded: each has a copy of its own.
#include "state/Simulation.h"
#include "state/Symbols.h"

namespace {

using tvx::sim::Simulation;
using tvx::sim::World;

// A scenario may leave entry points out; that has to be done before anybody looks them up.
[[gnu::constructor]] void on_load() {
  try {
    Simulation::instance().refresh();
    const auto names =
        Simulation::instance().with_world([](const World& world) { return world.omitted_symbols; });
    tvx::sim::hide_symbols(reinterpret_cast<const void*>(&on_load), names);
  } catch (...) {
    // Without memory the library simply has all its entry points.
  }
}

}  // namespace
