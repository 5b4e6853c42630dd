// A provider library of the test classes: the very bridge and runtime of the shipped one, the same
// kind of factories and exports, behind them providers that do what a test tells them.
#include <algorithm>
#include <cstring>
#include <iterator>
#include <map>
#include <mutex>
#include <stdexcept>
#include <string>

#include "Control.h"
#include "Play.h"
#include "Served_Names.h"
#include "Test_Classes.h"
#include "derivedObjects/Factory.h"

namespace cimrt::test {

namespace {

constexpr std::size_t num_classes = std::size(served_names);

constinit CMPI_Static_Data static_data[num_classes];

/// What a class has beside its static data.
struct Served {
  std::string provider_name;
  Scripted_Registration registration;
  Script script;
  std::map<std::uint32_t, std::string> broken;  ///< kinds of exceptions by operation
};

std::int32_t module_proc(const Registration* registration, std::uint32_t operation, void* arg0,
                         void* arg1, void* arg2, void* arg3, void* arg4, void* arg5, void* arg6,
                         void* arg7);

struct Module {
  Module() {
    for (std::size_t i = 0; i < num_classes; ++i) {
      Served& each = served[i];
      each.provider_name = std::string(served_names[i]) + "_Provider";
      each.registration.module_name = "cmpi_test_module";
      each.registration.provider_name = each.provider_name.c_str();
      each.registration.provider_proc = &module_proc;
      each.registration.meta_class =
          find_meta_class(Test_Classes::get().repository, served_names[i]);
      each.registration.next = i ? &served[i - 1].registration : nullptr;
      each.registration.script = &each.script;
      each.script.meta_class = each.registration.meta_class;
    }
  }

  static Module& get() {
    static Module module;
    return module;
  }
  Served& of(const char* class_name) {
    for (std::size_t i = 0; i < num_classes; ++i)
      if (std::strcmp(served_names[i], class_name) == 0) return served[i];
    throw std::logic_error(std::string("no such class: ") + class_name);
  }

  Served served[num_classes];
  std::mutex mutex;
  std::string notes;     ///< guarded by mutex
  std::string answered;  ///< guarded by mutex; what `asked` handed out
};

std::int32_t module_proc(const Registration* registration, std::uint32_t operation, void* arg0,
                         void* arg1, void* arg2, void* arg3, void* arg4, void* arg5, void* arg6,
                         void* arg7) {
  const std::int32_t status =
      scripted_proc(registration, operation, arg0, arg1, arg2, arg3, arg4, arg5, arg6, arg7);
  for (Served& each : Module::get().served) {
    if (&each.registration != registration) continue;
    const auto found = each.broken.find(operation);
    if (found != each.broken.end()) throw_kind(found->second);
  }
  return status;
}

void note(const std::string& line) {
  Module& module = Module::get();
  const std::lock_guard guard(module.mutex);
  module.notes += line + "\n";
}

void forget(Script& script) {
  script.get = nullptr;
  script.enumerate = nullptr;
  script.create = nullptr;
  script.erase = nullptr;
  script.modify = nullptr;
  script.invoke = nullptr;
  script.associator_names = nullptr;
  script.references = nullptr;
  script.associators = nullptr;
  script.on_create = nullptr;
  script.on_load = nullptr;
  script.on_unload = nullptr;
  script.enable = nullptr;
  script.statuses.clear();
  const std::lock_guard guard(script.mutex);
  script.calls.clear();
}

void reset() {
  Module& module = Module::get();
  for (Served& each : module.served) {
    forget(each.script);
    each.broken.clear();
  }
  const std::lock_guard guard(module.mutex);
  module.notes.clear();
}

void play_in(const char* class_name, std::uint32_t operation, const char* steps) {
  play(Module::get().of(class_name).script, operation, steps, &note);
}

void break_behind(const char* class_name, std::uint32_t operation, const char* kind) {
  auto& broken = Module::get().of(class_name).broken;
  if (kind)
    broken[operation] = kind;
  else
    broken.erase(operation);
}

const char* asked() {
  Module& module = Module::get();
  const std::lock_guard guard(module.mutex);
  module.answered = std::exchange(module.notes, "");
  return module.answered.c_str();
}

std::size_t count(const char* class_name, std::uint32_t operation) {
  return Module::get().of(class_name).script.count(operation);
}

void* interface(const char* class_name, const CMPIBroker* broker, const CMPIContext* context,
                char letter) {
  const auto index = static_cast<std::size_t>(&Module::get().of(class_name) - Module::get().served);
  return make_interface(index, broker, context, letter);
}

constexpr Control control = {&reset, &play_in, &break_behind, &asked, &count, &interface};

}  // namespace

}  // namespace cimrt::test

namespace cimrt {

void* make_interface(std::size_t index, const CMPIBroker* broker, const CMPIContext* context,
                     char letter) noexcept {
  const Registration& entry = test::Module::get().served[index].registration;
  void* result = nullptr;
  cimrt_cmpi_adapter('C', &test::static_data[index], &entry, broker, context, entry.provider_name,
                     letter, &result);
  return result;
}

}  // namespace cimrt

const cimrt::Registration* cimrt_module() noexcept {
  return &cimrt::test::Module::get().served[cimrt::test::num_classes - 1].registration;
}

const cimrt::test::Control* cmpi_test_control() noexcept {
  return &cimrt::test::control;
}
