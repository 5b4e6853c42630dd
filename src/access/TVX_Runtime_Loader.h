// Opens the management libraries and offers their functions under their own names.
#pragma once

#include <algorithm>
#include <atomic>
#include <cstddef>
#include <cstdint>
#include <string_view>
#include <type_traits>

#include "access/TVX_Entry_Points.h"
#include "rmapi/rmapi.h"

namespace cimrt {

/// Slots of the library handle table.
enum TVX_Library_Slot : int { TVX_SLOT_HBAAPI = 0, TVX_SLOT_LRMAPI, TVX_SLOT_RMAPI, TVX_SLOT_SDM };
inline constexpr int TVX_LIBRARY_SLOTS = 4;

/// Base names of the libraries, by slot.
inline constexpr const char* TVX_LIBRARY_NAMES[TVX_LIBRARY_SLOTS] = {"HBAAPI", "lrmapi", "rmapi",
                                                                     "tvsdm"};

/// 1 once the load found that a library is not there; 0 before.
extern std::atomic<int> LrmApiUnavailable;
extern std::atomic<int> RmApiUnavailable;
extern std::atomic<int> HbaApiUnavailable;
extern std::atomic<int> SdmUnavailable;  ///< never set

/// True as long as `SdmUnavailable` is 0.
bool isSdmAvailable();

/// Opens the libraries. Not a plain success code: 1 means that the older library name stands in,
/// 0 that the present one opened or that there is none at all. For one thread, before any stub.
int LoadRuntimeLibraries();

/// Closes what is open and forgets every looked-up function and every unavailable flag, so that the
/// libraries can be loaded again. Always 0. For one thread, after the last stub call returned.
int UnloadRuntimeLibraries();

/// Opens "lib<name>.so", or `name` itself if it begins with "HBA", into a slot (0 to 3) that is
/// still empty. 1 if the slot is filled, 0 on failure (logged).
int OpenRuntimeLibrary(int slot, const char* name);

/// The handle in a slot, null while nothing is open. For tests and for diagnosis.
void* runtimeLibraryHandle(int slot);

/// Looks an entry point of the table up by its family's rule. Null if it is not there. Logs
/// nothing, takes no lock; any thread.
void* resolveEntryPoint(std::size_t index);

/// The dynamic linker, replaceable by tests.
struct TVX_Dl_Operations {
  void* (*open)(const char* file, int mode);
  void* (*symbol)(void* handle, const char* name);
  int (*close)(void* handle);
  const char* (*error)();  ///< may return null
};

/// Installs replacements; null goes back to the system's. The object must stay.
void setDlOperations(const TVX_Dl_Operations* operations);

/// The dynamic linker in use: the installed replacement, or the system's. For whoever opens a
/// library that is not one of the management libraries. Any thread.
const TVX_Dl_Operations& dlOperations();

/// A name as a template argument.
template <std::size_t N>
struct TVX_Name {
  consteval TVX_Name(const char (&text)[N]) { std::copy_n(text, N, value); }
  constexpr std::string_view view() const { return {value, N - 1}; }
  char value[N] = {};
};

/// Stands for one function of a management library: calls it with the arguments unchanged, or
/// returns the missing value of its row. A function object, so that it can carry the name of the
/// library's own function without being mistaken for it.
template <TVX_Name Name, class Signature>
struct TVX_Stub;

template <TVX_Name Name, class Result, class... Arguments>
struct TVX_Stub<Name, Result(Arguments...)> {
  static constexpr std::size_t INDEX = entry_points::find(Name.view());
  static_assert(INDEX < entry_points::COUNT, "no such row in the table of entry points");
  static constexpr TVX_Missing MISSING = entry_points::TABLE[INDEX].missing;
  static_assert((MISSING == TVX_Missing::NOTHING) == std::is_void_v<Result>);

  Result operator()(Arguments... arguments) const {
    void* const address = resolveEntryPoint(INDEX);
    if (address == nullptr) return missing();
    return reinterpret_cast<Result (*)(Arguments...)>(address)(arguments...);
  }

 private:
  static Result missing() {
    if constexpr (std::is_pointer_v<Result>) {
      return nullptr;
    } else if constexpr (!std::is_void_v<Result>) {
      return MISSING == TVX_Missing::ONE    ? static_cast<Result>(1)
             : MISSING == TVX_Missing::ZERO ? static_cast<Result>(0)
                                            : static_cast<Result>(-1);
    }
  }
};

}  // namespace cimrt

#include "access/TVX_Stubs.h"
