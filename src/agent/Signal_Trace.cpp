#include "agent/Signal_Trace.h"

#include <execinfo.h>
#include <syslog.h>

#include <cstdlib>

namespace cimrt {

namespace {

constexpr int MAX_FRAMES = 16;

[[noreturn]] void traceSignal(int, siginfo_t*, void*) {
  syslog(LOG_INFO, "Signal in CIM Provider");
  syslog(LOG_INFO, "Back Trace Execution Path:");
  void* frames[MAX_FRAMES];
  const int count = backtrace(frames, MAX_FRAMES);
  char** texts = backtrace_symbols(frames, count);
  for (int i = 0; texts && i < count; i++) syslog(LOG_INFO, "Trace message [bt] %s", texts[i]);
  std::free(texts);
  std::exit(1);
}

}  // namespace

struct sigaction signalTraceAction() {
  struct sigaction action {};
  action.sa_sigaction = traceSignal;
  action.sa_flags = SA_SIGINFO;
  sigemptyset(&action.sa_mask);
  return action;
}

}  // namespace cimrt
