#include "runtime/Threads.h"

#include <sys/select.h>
#include <sys/time.h>

#include <cerrno>
#include <memory>

#include "runtime/Thread_Context.h"

namespace cimrt {
namespace {

constexpr std::uint64_t SECOND = 1000000;

/// What a new thread is told; owned by the creator until the thread runs.
struct Start_Record {
  Thread_Proc proc;
  void* arg;
  Thread_Context* context;  ///< made by the creator's context for this thread, or null
};

void* run_in_context(const Start_Record& start) {
  Thread_Context::push(start.context);
  start.context->thread_start_hook();
  void* result = start.proc(start.arg);
  start.context->thread_exit_hook();
  return result;
}

void* _thread_proc(void* record) {
  const Start_Record start = *static_cast<Start_Record*>(record);
  delete static_cast<Start_Record*>(record);
  Thread_Context* context = start.context;
  void* result = context ? run_in_context(start) : start.proc(start.arg);
  CIMRT_ASSERT(context == Thread_Context::top());
  if (context) {
    Thread_Context::pop();
    delete context;
  }
  return result;
}

int start_thread(pthread_t& id, bool detached, Start_Record* record) {
  pthread_attr_t attributes;
  pthread_attr_init(&attributes);
  pthread_attr_setdetachstate(&attributes,
                              detached ? PTHREAD_CREATE_DETACHED : PTHREAD_CREATE_JOINABLE);
  const int error = pthread_create(&id, &attributes, _thread_proc, record);
  pthread_attr_destroy(&attributes);
  return error;
}

}  // namespace

Mutex::Mutex(bool recursive) : _mutex{} {
  pthread_mutexattr_t attributes;
  pthread_mutexattr_init(&attributes);
  if (recursive) pthread_mutexattr_settype(&attributes, PTHREAD_MUTEX_RECURSIVE);
  pthread_mutex_init(&_mutex, &attributes);
  pthread_mutexattr_destroy(&attributes);
}

Mutex::~Mutex() {
  pthread_mutex_destroy(&_mutex);
}

void Mutex::lock() {
  if (pthread_mutex_lock(&_mutex) != 0)
    Thread_Context::__cimrt_assert(__FILE__, __LINE__, __PRETTY_FUNCTION__,
                                   "pthread_mutex_lock(&((MutexRep*)_rep)->mutex) == 0");
}

void Mutex::unlock() {
  pthread_mutex_unlock(&_mutex);
}

int Mutex::try_lock() {
  const int error = pthread_mutex_trylock(&_mutex);
  return error == 0 || error == EBUSY ? error : -1;
}

Cond::Cond() : _cond{} {
  pthread_cond_init(&_cond, nullptr);
}

Cond::~Cond() {
  pthread_cond_destroy(&_cond);
}

void Cond::wait(Mutex& mutex) {
  pthread_cond_wait(&_cond, mutex.native());
}

void Cond::signal() {
  pthread_cond_signal(&_cond);
}

void Cond::broadcast() {
  pthread_cond_broadcast(&_cond);
}

void Time::sleep(std::uint64_t usec) {
  timeval tv = {};
  tv.tv_sec = static_cast<time_t>(usec / SECOND);
  tv.tv_usec = static_cast<suseconds_t>(usec % SECOND);
  select(0, nullptr, nullptr, nullptr, &tv);
}

std::uint64_t Time::now() {
  timeval tv = {};
  gettimeofday(&tv, nullptr);
  return static_cast<std::uint64_t>(tv.tv_sec) * SECOND + static_cast<std::uint64_t>(tv.tv_usec);
}

Thread Thread::self() {
  Thread thread;
  thread._id = pthread_self();
  return thread;
}

bool Thread::equal(const Thread& a, const Thread& b) {
  return pthread_equal(a._id, b._id) != 0;
}

int Thread::join(const Thread& thread, void*& out) {
  out = nullptr;
  return pthread_join(thread._id, &out);
}

void Thread::exit(void* result) {
  if (Thread_Context* context = Thread_Context::top()) context->thread_exit_hook();
  pthread_exit(result);
}

int Thread::create(Thread& thread, Thread_Proc proc, void* arg, bool detached) {
  auto record = std::make_unique<Start_Record>(Start_Record{proc, arg, nullptr});
  if (Thread_Context* top = Thread_Context::top()) record->context = top->thread_create_hook(arg);
  const int error = start_thread(thread._id, detached, record.get());
  if (error == 0) {
    static_cast<void>(record.release());  // the new thread deletes it
  } else {
    delete record->context;  // the caller's own context stays with whoever pushed it
  }
  return error;
}

int Thread::create_joinable(Thread& thread, Thread_Proc proc, void* arg) {
  return create(thread, proc, arg, false);
}

int Thread::create_detached(Thread& thread, Thread_Proc proc, void* arg) {
  return create(thread, proc, arg, true);
}

}  // namespace cimrt
