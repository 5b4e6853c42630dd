#include "runtime/Thread_Context.h"

#include <pthread.h>

#include <cstdio>
#include <cstdlib>
#include <utility>

namespace cimrt {
namespace {

pthread_key_t _thread_context_key;
pthread_once_t _thread_context_key_once = PTHREAD_ONCE_INIT;

void make_key() {
  pthread_key_create(&_thread_context_key, nullptr);
}

void set_top(Thread_Context* context) {
  pthread_setspecific(_thread_context_key, context);
}

}  // namespace

Thread_Context::~Thread_Context() = default;

Thread_Context* Thread_Context::top() {
  pthread_once(&_thread_context_key_once, make_key);
  return static_cast<Thread_Context*>(pthread_getspecific(_thread_context_key));
}

void Thread_Context::push(Thread_Context* context) {
  context->_prev = top();
  set_top(context);
}

void Thread_Context::pop() {
  Thread_Context* context = top();
  if (context) set_top(std::exchange(context->_prev, nullptr));
}

void Thread_Context::__cimrt_trace(const char* file, int line, const char* text) {
  std::fprintf(stderr, "TRACE: %s(%d): %s\n", file, line, text);
}

void Thread_Context::__cimrt_assert(const char* file, int line, const char* function,
                                    const char* text) {
  std::fprintf(stderr, "%s(%d): %s(): assert: %s\n\n", file, line, function, text);
  std::abort();
}

}  // namespace cimrt
