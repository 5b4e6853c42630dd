#include "cmpi/Operation_Frame.h"

#include "cmpi/Status_Map.h"

namespace cimrt {

namespace {

/// Innermost request of the calling thread.
thread_local Request_Guard* innermost = nullptr;

}  // namespace

Request_Guard::Request_Guard(CMPI_Static_Data* static_data)
    : _static_data(static_data), _nested(inside(static_data)), _outer(innermost) {
  if (_nested) {
    _adapter = static_data->adapter;
  } else {
    const Load_Guard guard(static_data);
    _adapter = static_data->adapter;
    if (_adapter) static_data->requests.fetch_add(1);
  }
  innermost = this;
}

Request_Guard::~Request_Guard() {
  innermost = _outer;
  if (_nested || !_adapter) return;
  if (_static_data->requests.fetch_sub(1) == 1) _static_data->requests.notify_all();
}

bool Request_Guard::inside(const CMPI_Static_Data* static_data) {
  for (const Request_Guard* guard = innermost; guard; guard = guard->_outer)
    if (guard->_static_data == static_data && guard->_adapter) return true;
  return false;
}

void Request_Guard::wait_until_idle(CMPI_Static_Data* static_data) {
  for (std::uint32_t running = static_data->requests.load(); running != 0;
       running = static_data->requests.load())
    static_data->requests.wait(running);
}

Context_Guard::Context_Guard(const CMPIBroker* broker, const CMPIContext* context,
                             CMPI_Adapter* adapter)
    : _context(std::make_unique<CMPI_Thread_Context>(broker, context, adapter)) {
  Thread_Context::push(_context.get());
}

Context_Guard::~Context_Guard() {
  Thread_Context::pop();
}

void log_return(const char* function, const Outcome& outcome) noexcept {
  const char* code = name_of_code(outcome.logged);
  try {
    if (outcome.detail)
      CIMRT_TRACE(LOG_DBG_, "return: %s(): %s %s", function, code, outcome.detail->c_str());
    else
      CIMRT_TRACE(LOG_DBG_, "return: %s(): %s", function, code);
  } catch (...) {
    // The server's answer stands without the line.
  }
}

}  // namespace cimrt
