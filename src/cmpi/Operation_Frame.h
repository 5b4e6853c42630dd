// What every operation runs in: thread context, adapter lock, log lines, and the barrier that keeps
// exceptions inside.
#pragma once

#include <exception>
#include <memory>
#include <optional>

#include "cmpi/CMPI_Adapter.h"
#include "cmpi/CMPI_Thread_Context.h"
#include "runtime/Log.h"

namespace cimrt {

/// What an operation ends with.
struct Outcome {
  Outcome(CMPIrc code) : answer(code), logged(code) {}
  Outcome(CMPIrc code, const char* text) : answer(code), logged(code), detail(text) {}

  CMPIrc answer;  ///< what the server gets
  CMPIrc logged;  ///< what the return line says; differs from the answer in a few cases
  std::optional<String> detail{};  ///< appended to the return line, even if it is empty
};

/// A status with this code and no message.
inline CMPIStatus status_of(CMPIrc code) {
  return CMPIStatus{code, nullptr};
}

/// Holds `load_lock` of a class.
class Load_Guard {
 public:
  explicit Load_Guard(CMPI_Static_Data* static_data) : _static_data(static_data) {
    pthread_mutex_lock(&_static_data->load_lock);
  }
  ~Load_Guard() { pthread_mutex_unlock(&_static_data->load_lock); }
  Load_Guard(const Load_Guard&) = delete;
  Load_Guard& operator=(const Load_Guard&) = delete;

 private:
  CMPI_Static_Data* _static_data;
};

/// Keeps the adapter of a class alive while a request of this thread is inside it. A request that
/// comes after the unloading finds no adapter. Requests of one thread nest.
class Request_Guard {
 public:
  explicit Request_Guard(CMPI_Static_Data* static_data);
  ~Request_Guard();
  Request_Guard(const Request_Guard&) = delete;
  Request_Guard& operator=(const Request_Guard&) = delete;

  CMPI_Adapter* adapter() const { return _adapter; }

  /// True if the calling thread is inside a request of this class.
  static bool inside(const CMPI_Static_Data* static_data);
  /// Waits until no thread is inside; the caller holds `load_lock`, so that none gets in.
  static void wait_until_idle(CMPI_Static_Data* static_data);

 private:
  CMPI_Static_Data* _static_data;
  CMPI_Adapter* _adapter = nullptr;
  const bool _nested;
  Request_Guard* const _outer;
};

/// Pushes a context for a scope.
class Context_Guard {
 public:
  Context_Guard(const CMPIBroker* broker, const CMPIContext* context, CMPI_Adapter* adapter);
  ~Context_Guard();
  Context_Guard(const Context_Guard&) = delete;
  Context_Guard& operator=(const Context_Guard&) = delete;

 private:
  std::unique_ptr<CMPI_Thread_Context> _context;
};

/// Logs the return line of an operation; one that there is no memory for is lost.
void log_return(const char* function, const Outcome& outcome) noexcept;

/// The static data behind a management interface.
template <class MI>
CMPI_Static_Data* static_data_of(const MI* mi) {
  return static_cast<CMPI_Static_Data*>(const_cast<void*>(static_cast<const void*>(mi->hdl)));
}

/// Runs `work(adapter)`, which answers an `Outcome`, inside the frame of one operation. What it
/// throws ends as CMPI_RC_ERR_FAILED.
template <class MI, class Work>
CMPIStatus run_operation(const MI* mi, const CMPIContext* context, const char* function,
                         Work&& work) noexcept {
  try {
    const Request_Guard request(static_data_of(mi));
    CMPI_Adapter* adapter = request.adapter();
    if (!adapter) return status_of(CMPI_RC_ERR_FAILED);

    const Context_Guard pushed(adapter->broker, context, adapter);
    const Auto_Mutex locked(adapter->lock);
    CIMRT_TRACE(LOG_DBG_, "enter: %s()", function);
    Outcome outcome(CMPI_RC_ERR_FAILED);
    try {
      outcome = work(*adapter);
    } catch (...) {
      // The provider's failure; the outcome says so already.
    }
    log_return(function, outcome);
    return status_of(outcome.answer);
  } catch (...) {
    return status_of(CMPI_RC_ERR_FAILED);
  }
}

}  // namespace cimrt
