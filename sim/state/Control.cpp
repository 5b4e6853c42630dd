#include <string>

#include "state/Events.h"
#include "state/Scenario_Parts.h"
#include "state/Simulation.h"
#include "tvxsim/tvxsim.h"

using namespace tvx::sim;

namespace {

thread_local std::string last_error;

// Runs `body`, which answers what went wrong, and turns that into the result of a C call.
template <class Body>
int report(Body&& body) noexcept {
  try {
    last_error = body();
  } catch (const std::exception& error) {
    last_error = error.what();
  }
  return last_error.empty() ? 0 : -1;
}

}  // namespace

extern "C" {

int tvxsim_load(const char* path) {
  return report([path] { return Simulation::instance().load_file(path ? path : ""); });
}

int tvxsim_load_text(const char* json) {
  return report([json] { return Simulation::instance().load_text(json ? json : ""); });
}

const char* tvxsim_last_error(void) {
  return last_error.c_str();
}

int tvxsim_add_fault(const char* json) {
  return report([json] {
    const nlohmann::json object = nlohmann::json::parse(json ? json : "");
    Fault_Rule rule = read_fault(Json_Reader(object, ""));
    Simulation::instance().with_world(
        [&rule](World& world) { world.faults.push_back(std::move(rule)); });
    return std::string();
  });
}

void tvxsim_clear_faults(void) {
  report([] {
    Simulation::instance().with_world([](World& world) { world.faults.clear(); });
    return std::string();
  });
}

unsigned long tvxsim_calls(const char* entry_point, const char* wwpn) {
  unsigned long count = 0;
  report([&] {
    const std::optional<Wwn> port = parse_wwn(wwpn ? wwpn : "");
    if (wwpn != nullptr && !port) return std::string(wwpn) + " is not a world wide name";
    count = Simulation::instance().calls(entry_point ? entry_point : "", port ? &*port : nullptr);
    return std::string();
  });
  return count;
}

void tvxsim_forget_calls(void) {
  Simulation::instance().forget_calls();
}

void tvxsim_advance(unsigned seconds) {
  report([seconds] {
    Simulation::instance().with_world([seconds](World& world) { world.advanced += seconds; });
    return std::string();
  });
}

void tvxsim_hold_clock(int held) {
  report([held] {
    Simulation::instance().with_world([held](World& world) { world.clock_held = held != 0; });
    return std::string();
  });
}

int tvxsim_set_link(const char* wwpn, const char* json) {
  return report([=] {
    const std::optional<Wwn> name = parse_wwn(wwpn ? wwpn : "");
    const nlohmann::json object = nlohmann::json::parse(json ? json : "");
    return Simulation::instance().with_world([&](World& world) -> std::string {
      Port* port = name ? world.find_port(*name) : nullptr;
      if (port == nullptr) return "no such port";
      const Json_Reader reader(object, "");
      Port changed = *port;
      read_link(reader, changed);
      reader.finish();
      *port = std::move(changed);
      return {};
    });
  });
}

int tvxsim_post_event(const char* wwpn, unsigned type, unsigned fabric_port) {
  int called = 0;
  const int status = report([&] {
    const std::optional<Wwn> port = parse_wwn(wwpn ? wwpn : "");
    if (!port) return std::string("not a world wide name");
    called = post_event(*port, type, fabric_port);
    return std::string();
  });
  return status == 0 ? called : -1;
}

unsigned tvxsim_open_handles(void) {
  unsigned count = 0;
  report([&count] {
    count = Simulation::instance().with_world(
        [](const World& world) { return static_cast<unsigned>(world.handles.size()); });
    return std::string();
  });
  return count;
}

}  // extern "C"
