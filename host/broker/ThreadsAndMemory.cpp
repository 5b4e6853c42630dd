// The broker's tables of thread functions, over POSIX threads, and of memory functions.
#include <pthread.h>
#include <time.h>

#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <string>

#include "broker/Core.h"

namespace tvx::host {
namespace {

static_assert(sizeof(pthread_t) <= sizeof(void*) && sizeof(pthread_once_t) == sizeof(int));

pthread_t threadOf(CMPI_THREAD_TYPE thread) {
  return reinterpret_cast<std::uintptr_t>(thread);
}

char* resolveFileName(const char* name) {
  return name == nullptr ? nullptr : strdup(("lib" + std::string(name) + ".so").c_str());
}

CMPI_THREAD_TYPE newThread(CMPI_THREAD_RETURN (*start)(void*), void* parameter, int detached) {
  pthread_t thread{};
  if (pthread_create(&thread, nullptr, start, parameter) != 0) {
    return nullptr;
  }
  if (detached != 0) {
    pthread_detach(thread);
  }
  return reinterpret_cast<CMPI_THREAD_TYPE>(thread);
}

int joinThread(CMPI_THREAD_TYPE thread, CMPI_THREAD_RETURN* result) {
  return pthread_join(threadOf(thread), result);
}
int exitThread(CMPI_THREAD_RETURN result) {
  pthread_exit(result);
}
int cancelThread(CMPI_THREAD_TYPE thread) {
  return pthread_cancel(threadOf(thread));
}

int threadSleep(CMPIUint32 milliseconds) {
  const timespec wait{static_cast<time_t>(milliseconds / 1000),
                      static_cast<long>(milliseconds % 1000) * 1000000};
  return nanosleep(&wait, nullptr);
}

int threadOnce(int* once, void (*function)()) {
  return pthread_once(once, function);
}
int createThreadKey(unsigned int* key, void (*cleanup)(void*)) {
  return pthread_key_create(key, cleanup);
}
int destroyThreadKey(unsigned int key) {
  return pthread_key_delete(key);
}
void* getThreadSpecific(unsigned int key) {
  return pthread_getspecific(key);
}
int setThreadSpecific(unsigned int key, void* value) {
  return pthread_setspecific(key, value);
}

CMPI_MUTEX_TYPE newMutex(int) {
  auto mutex = std::make_unique<pthread_mutex_t>();
  return pthread_mutex_init(mutex.get(), nullptr) == 0 ? mutex.release() : nullptr;
}
void destroyMutex(CMPI_MUTEX_TYPE mutex) {
  const std::unique_ptr<pthread_mutex_t> owned(static_cast<pthread_mutex_t*>(mutex));
  if (owned) {
    pthread_mutex_destroy(owned.get());
  }
}
void lockMutex(CMPI_MUTEX_TYPE mutex) {
  pthread_mutex_lock(static_cast<pthread_mutex_t*>(mutex));
}
void unlockMutex(CMPI_MUTEX_TYPE mutex) {
  pthread_mutex_unlock(static_cast<pthread_mutex_t*>(mutex));
}

CMPI_COND_TYPE newCondition(int) {
  auto condition = std::make_unique<pthread_cond_t>();
  return pthread_cond_init(condition.get(), nullptr) == 0 ? condition.release() : nullptr;
}
void destroyCondition(CMPI_COND_TYPE condition) {
  const std::unique_ptr<pthread_cond_t> owned(static_cast<pthread_cond_t*>(condition));
  if (owned) {
    pthread_cond_destroy(owned.get());
  }
}
int condWait(CMPI_COND_TYPE condition, CMPI_MUTEX_TYPE mutex) {
  return pthread_cond_wait(static_cast<pthread_cond_t*>(condition),
                           static_cast<pthread_mutex_t*>(mutex));
}
int timedCondWait(CMPI_COND_TYPE condition, CMPI_MUTEX_TYPE mutex, timespec* until) {
  return pthread_cond_timedwait(static_cast<pthread_cond_t*>(condition),
                                static_cast<pthread_mutex_t*>(mutex), until);
}
int signalCondition(CMPI_COND_TYPE condition) {
  return pthread_cond_signal(static_cast<pthread_cond_t*>(condition));
}

// ---- Memory: blocks are counted; objects live until their request ends ----

CMPIGcStat* mark(const CMPIBroker* broker, CMPIStatus* rc) {
  if (rc != nullptr) {
    *rc = CMPIStatus{CMPI_RC_OK, nullptr};
  }
  return reinterpret_cast<CMPIGcStat*>(&Core::of(broker).owner());
}

CMPIStatus releaseMark(const CMPIBroker*, const CMPIGcStat* token) {
  return CMPIStatus{token == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_OK, nullptr};
}

void* counted(const CMPIBroker* broker, void* block) {
  if (block != nullptr) {
    Core::of(broker).owner().countBlock(1);
  }
  return block;
}

void* cmpiMalloc(const CMPIBroker* broker, std::size_t size) {
  return counted(broker, std::malloc(size));
}
void* cmpiCalloc(const CMPIBroker* broker, std::size_t count, std::size_t size) {
  return counted(broker, std::calloc(count, size));
}
void* cmpiRealloc(const CMPIBroker* broker, void* block, std::size_t size) {
  return block == nullptr ? cmpiMalloc(broker, size) : std::realloc(block, size);
}
char* cmpiStrDup(const CMPIBroker* broker, const char* text) {
  return text == nullptr ? nullptr : static_cast<char*>(counted(broker, strdup(text)));
}
void cmpiFree(const CMPIBroker* broker, void* block) {
  if (block != nullptr) {
    Core::of(broker).owner().countBlock(-1);
    std::free(block);
  }
}

template <class Face>
void freeObject(const CMPIBroker*, Face* object) {
  if (object != nullptr) {
    object->ft->release(object);
  }
}

}  // namespace

const CMPIBrokerExtFT threadTable = {
    CMPIVersion200,    resolveFileName,   newThread,        joinThread,      exitThread,
    cancelThread,      threadSleep,       threadOnce,       createThreadKey, destroyThreadKey,
    getThreadSpecific, setThreadSpecific, newMutex,         destroyMutex,    lockMutex,
    unlockMutex,       newCondition,      destroyCondition, condWait,        timedCondWait,
    signalCondition,   nullptr,           nullptr,          nullptr,         nullptr,
};

const CMPIBrokerMemFT memoryTable = {
    CMPIVersion200,
    mark,
    releaseMark,
    cmpiMalloc,
    cmpiCalloc,
    cmpiRealloc,
    cmpiStrDup,
    cmpiFree,
    freeObject<CMPIInstance>,
    freeObject<CMPIObjectPath>,
    freeObject<CMPIArgs>,
    freeObject<CMPIString>,
    freeObject<CMPIArray>,
    freeObject<CMPIDateTime>,
    freeObject<CMPISelectExp>,
    nullptr,
};

}  // namespace tvx::host
