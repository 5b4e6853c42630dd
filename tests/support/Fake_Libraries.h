// Management libraries made of functions of the test, below the loader.
#pragma once

#include <dlfcn.h>

#include <cstdint>
#include <functional>
#include <map>
#include <set>
#include <string>
#include <type_traits>
#include <utility>
#include <vector>

#include "access/TVX_Runtime_Loader.h"

namespace tvx::test {

/// Stands in for the dynamic linker while it lives. At first there is no library. One object at a
/// time; unloads the libraries at the end.
class Fake_Libraries {
 public:
  Fake_Libraries() {
    current() = this;
    static constexpr cimrt::TVX_Dl_Operations OPERATIONS = {&open, &symbol, &close, &error};
    cimrt::setDlOperations(&OPERATIONS);
  }
  ~Fake_Libraries() {
    closeResult = 0;
    cimrt::UnloadRuntimeLibraries();
    cimrt::setDlOperations(nullptr);
    current() = nullptr;
  }
  Fake_Libraries(const Fake_Libraries&) = delete;
  Fake_Libraries& operator=(const Fake_Libraries&) = delete;

  /// Makes a file that can be opened ("liblrmapi.so").
  Fake_Libraries& with(const std::string& file) {
    _files.insert(file);
    return *this;
  }
  /// Makes both libraries of a complete machine and loads them.
  void load() {
    with("HBAAPI.so.2").with("liblrmapi.so");
    cimrt::LoadRuntimeLibraries();
  }

  /// Gives the function behind a stub: every library has it, under its first name.
  template <cimrt::TVX_Name Name, class Result, class... Arguments, class Function>
  void provide(cimrt::TVX_Stub<Name, Result(Arguments...)>, Function function) {
    provideAs(std::string(Name.view()), cimrt::TVX_Stub<Name, Result(Arguments...)>{},
              std::move(function));
  }
  /// The same under a name of one's own.
  template <cimrt::TVX_Name Name, class Result, class... Arguments, class Function>
  void provideAs(const std::string& name, cimrt::TVX_Stub<Name, Result(Arguments...)>,
                 Function function) {
    Slot<Name, Result, Arguments...>::function = std::move(function);
    _symbols[name] = reinterpret_cast<void*>(&Slot<Name, Result, Arguments...>::call);
  }
  /// Takes it away again. A library that was asked before keeps it in the loader's cache.
  void remove(const std::string& name) { _symbols.erase(name); }

  /// One lookup: the file of the library (empty for the default scope) and the name.
  using Lookup = std::pair<std::string, std::string>;
  std::vector<Lookup> lookups;
  std::vector<std::string> opens;
  std::vector<std::string> closes;
  int closeResult = 0;
  const char* errorText = "no such library";

 private:
  template <cimrt::TVX_Name Name, class Result, class... Arguments>
  struct Slot {
    static inline std::function<Result(Arguments...)> function;
    static Result call(Arguments... arguments) { return function(arguments...); }
  };

  static Fake_Libraries*& current() {
    static Fake_Libraries* object = nullptr;
    return object;
  }
  // The handle of a library is the address of its name in `_files`.
  static void* open(const char* file, int mode) {
    Fake_Libraries& self = *current();
    self.opens.push_back(mode == RTLD_NOW ? file : "not RTLD_NOW");
    const auto found = self._files.find(file);
    if (found == self._files.end()) return nullptr;
    return const_cast<std::string*>(&*found);
  }
  static void* symbol(void* handle, const char* name) {
    Fake_Libraries& self = *current();
    self.lookups.emplace_back(handle != nullptr ? *static_cast<std::string*>(handle) : "", name);
    const auto found = self._symbols.find(name);
    return found != self._symbols.end() ? found->second : nullptr;
  }
  static int close(void* handle) {
    current()->closes.push_back(*static_cast<std::string*>(handle));
    return current()->closeResult;
  }
  static const char* error() { return current()->errorText; }

  std::set<std::string> _files;
  std::map<std::string, void*> _symbols;
};

}  // namespace tvx::test
