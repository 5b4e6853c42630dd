// Module entry of a provider class: the CMPI function tables and the adapter behind them.
//
// Conventions of this boundary:
//  1. One `CMPI_Static_Data` per class outlives everything; function tables point back to it, so a
//     call that comes after the unloading is answered, not followed into freed memory.
//  2. The first factory call of a class makes its adapter, every further one adds to its
//     `load_count`; each clean-up takes one off, and the last one unloads and destroys.
//  3. Every operation runs with a `CMPI_Thread_Context` pushed and the adapter's lock held.
//  4. No exception leaves: what a provider throws becomes CMPI_RC_ERR_FAILED.
//  5. Objects of the server belong to the request; none is kept beyond it.
//  6. To `proc` texts travel as `const String*`, callbacks as `Instance_Proc` cast to a pointer,
//     places for a result as a pointer to the caller's variable.
#pragma once

#include <pthread.h>

#include <atomic>
#include <cstdint>
#include <memory>

#include "cmpi/cmpidt.h"
#include "cmpi/cmpift.h"
#include "runtime/Array.h"
#include "runtime/Provider_Operations.h"
#include "runtime/String.h"
#include "runtime/Threads.h"

namespace cimrt {

class CMPI_Adapter;

inline constexpr std::uint32_t CMPI_STATIC_DATA_MAGIC = 0x5DE2B131;
inline constexpr std::uint32_t CMPI_STATIC_DATA_DEAD = 0xDDDDDDDD;
inline constexpr std::size_t CMPI_NAME_SIZE = 256;

/// What the function tables of one class point back to: one static object per class, needing no
/// initialiser beyond its declaration and never destroyed.
struct CMPI_Static_Data {
  std::uint32_t magic{};    ///< `CMPI_STATIC_DATA_MAGIC` while there is an adapter
  CMPI_Adapter* adapter{};  ///< null until the first factory call and after the last clean-up

  CMPIInstanceMIFT instance_mift{};
  CMPIMethodMIFT method_mift{};
  CMPIIndicationMIFT indication_mift{};
  CMPIAssociationMIFT association_mift{};

  CMPIInstanceMI instance_mi{};
  CMPIMethodMI method_mi{};
  CMPIIndicationMI indication_mi{};
  CMPIAssociationMI association_mi{};

  char instance_name[CMPI_NAME_SIZE]{};
  char method_name[CMPI_NAME_SIZE]{};
  char indication_name[CMPI_NAME_SIZE]{};
  char association_name[CMPI_NAME_SIZE]{};

  /// Held while the adapter is made, counted or destroyed; recursive, as a provider's load may make
  /// the server ask for the same class again.
  pthread_mutex_t load_lock = PTHREAD_RECURSIVE_MUTEX_INITIALIZER_NP;
  /// Threads inside an operation of this class; the destruction waits for them.
  std::atomic<std::uint32_t> requests{};
};

/// One indication filter: how often a namespace was activated.
struct Indication_Filter {
  String name_space;
  std::uint32_t count;
};

extern const Array_Traits indication_filter_traits;
template <>
inline const Array_Traits* traits_of<Indication_Filter>() {
  return &indication_filter_traits;
}

/// The bridge of one class between the server's calls and the class's `proc`.
class CMPI_Adapter {
 public:
  /// Creates and loads the provider. `static_data->adapter` is set before the provider's load runs.
  CMPI_Adapter(const CMPIBroker* broker, const CMPIContext* context, const char* name,
               const Registration* registration, CMPI_Static_Data* static_data);
  /// Destroys the provider, which must have been unloaded. No request may be running.
  ~CMPI_Adapter();
  CMPI_Adapter(const CMPI_Adapter&) = delete;
  CMPI_Adapter& operator=(const CMPI_Adapter&) = delete;

  /// Calls the class's `proc` with an operation code and its arguments.
  template <class... Args>
  std::int32_t call(std::uint32_t operation, Args... args) const;

  // Constant after construction.
  const Registration* registration;
  Provider_Proc provider_proc;
  void* provider = nullptr;
  const CMPIBroker* broker = nullptr;
  CMPI_Static_Data* static_data;

  // Guarded by `static_data->load_lock`.
  std::uint64_t load_count = 0;  ///< function tables handed out

  /// Cleared by a provider that must stay loaded; shared with the contexts of its threads.
  std::shared_ptr<std::atomic<bool>> allow_unload = std::make_shared<std::atomic<bool>>(true);

  // Guarded by `lock`.
  Array<Indication_Filter> indication_filters;

  const Meta_Class* meta_class = nullptr;  ///< constant after construction

  bool indications_enabled = false;  ///< guarded by `lock`
  Mutex lock{true};                  ///< held by every operation

 private:
  void fill_static_data(const char* name);
};

/// Passes `args` on as the pointer-sized arguments that `proc` takes; missing ones are null.
template <class... Args>
std::int32_t CMPI_Adapter::call(std::uint32_t operation, Args... args) const {
  static_assert(sizeof...(args) <= 8);
  void* all[8] = {const_cast<void*>(reinterpret_cast<const void*>(args))...};
  return provider_proc(registration, operation, all[0], all[1], all[2], all[3], all[4], all[5],
                       all[6], all[7]);
}

/// What every exported factory calls. Safe to call from several threads.
/// @param reserved     'C', ignored
/// @param static_data  the class's static data
/// @param registration the class's registration
/// @param broker       the calling server; used as long as the adapter lives
/// @param context      context of this call
/// @param name         "<Class>_Provider"
/// @param letter       'I', 'M', 'A' or 'N' for an instance, method, association or indication
///                     interface
/// @param result       receives the interface (owned by `static_data`); left alone for any other
///                     letter
/// @return always 0
int cimrt_cmpi_adapter(char reserved, CMPI_Static_Data* static_data,
                       const Registration* registration, const CMPIBroker* broker,
                       const CMPIContext* context, const char* name, char letter,
                       void** result) noexcept;

}  // namespace cimrt
