#include "state/Simulation.h"

#include <sys/stat.h>

#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <thread>

#include "state/Persist.h"
#include "state/Scenario.h"

namespace tvx::sim {
namespace {

std::string environment(const char* variable) {
  const char* value = std::getenv(variable);
  return value == nullptr ? std::string() : std::string(value);
}

std::string environment_path() {
  return environment("TVX_SIM_SCENARIO");
}

// One line for the user; the libraries have no other way to say it.
void complain(const std::string& message) {
  std::fprintf(stderr, "tvxsim: %s\n", message.c_str());
}

// Tells two states of a file apart.
std::string file_stamp(const std::string& path) {
  struct stat info {};
  if (path.empty() || stat(path.c_str(), &info) != 0) return path;
  return path + ":" + std::to_string(info.st_size) + ":" + std::to_string(info.st_ino) + ":" +
         std::to_string(info.st_mtim.tv_sec) + "." + std::to_string(info.st_mtim.tv_nsec);
}

// Completes what a call is about from what it named.
void complete(Call_Site& site, World& world) {
  for (const Adapter& adapter : world.adapters) {
    if (site.adapter.empty() && site.port) {
      for (const std::size_t index : adapter.ports) {
        if (world.ports[index].names.port == *site.port) site.adapter = adapter.name;
      }
    } else if (!site.port && site.adapter == adapter.name && adapter.ports.size() == 1) {
      site.port = world.ports[adapter.ports.front()].names.port;
    }
  }
}

}  // namespace

Simulation& Simulation::instance() {
  // Never destroyed: other threads may still call while the process ends.
  static Simulation* const simulation = new Simulation;
  return *simulation;
}

void Simulation::refresh() {
  const std::lock_guard<std::mutex> guard(m_Mutex);
  if (m_bPinned) return;
  if (!m_bLoaded || m_Stamp != file_stamp(environment_path())) load_environment();
}

void refresh_quietly() noexcept {
  try {
    Simulation::instance().refresh();
  } catch (...) {
    return;
  }
}

void Simulation::ensure_world() {
  if (!m_bLoaded) load_environment();
}

void Simulation::load_environment() {
  const std::string path = environment_path();
  m_Stamp = file_stamp(path);
  m_bPinned = false;
  replace_world(path, {});
}

// Makes the world anew from a text, a file, or (both empty) the built-in scenario.
std::string Simulation::replace_world(const std::string& source, const std::string& text) {
  m_bLoaded = true;
  m_Calls.clear();
  try {
    if (!text.empty()) {
      m_World = parse_scenario(text, source);
    } else {
      m_World = source.empty() ? default_scenario() : load_scenario(source);
    }
    restore_world();
    return {};
  } catch (const std::exception& error) {
    m_World = World();
    m_World.scenario = source;
    std::string message = source + ": " + error.what();
    complain(message);
    return message;
  }
}

void Simulation::restore_world() {
  m_StatePath = environment("TVX_SIM_STATE");
  if (m_StatePath.empty()) return;
  const std::string problem = restore_state(m_World, m_StatePath);
  if (problem.empty()) return;
  complain(m_StatePath + ": " + problem + "; changes are not kept");
  m_StatePath.clear();
}

void Simulation::end_call(std::string_view name) {
  if (m_StatePath.empty() || !changes_state(name)) return;
  const std::string problem = save_state(m_World, m_StatePath);
  if (problem.empty()) return;
  complain(m_StatePath + ": " + problem + "; changes are not kept");
  m_StatePath.clear();
}

std::string Simulation::load_file(const std::string& path) {
  const std::lock_guard<std::mutex> guard(m_Mutex);
  m_bPinned = !path.empty();
  const std::string source = m_bPinned ? path : environment_path();
  m_Stamp = file_stamp(source);
  return replace_world(source, {});
}

std::string Simulation::load_text(const std::string& text) {
  const std::lock_guard<std::mutex> guard(m_Mutex);
  m_bPinned = true;
  return replace_world("text", text.empty() ? "{}" : text);
}

Fault_Effect Simulation::begin_call(Call_Site site) {
  Fault_Effect effect;
  {
    const std::lock_guard<std::mutex> guard(m_Mutex);
    ensure_world();
    complete(site, m_World);
    ++m_Calls[std::string(entry_point(site.name))][site.port.value_or(Wwn{})];
    effect = apply_rules(m_World.faults, site);
  }
  if (effect.delay_ms != 0) {
    std::this_thread::sleep_for(std::chrono::milliseconds(effect.delay_ms));
  }
  return effect;
}

std::uint64_t Simulation::calls(const std::string& name, const Wwn* port) {
  const std::lock_guard<std::mutex> guard(m_Mutex);
  const auto found = m_Calls.find(entry_point(name));
  if (found == m_Calls.end()) return 0;
  std::uint64_t sum = 0;
  for (const auto& [who, count] : found->second) {
    if (port == nullptr || who == *port) sum += count;
  }
  return sum;
}

void Simulation::forget_calls() {
  const std::lock_guard<std::mutex> guard(m_Mutex);
  m_Calls.clear();
}

}  // namespace tvx::sim
