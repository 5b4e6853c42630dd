// Threads as small servers give them to requests.
#pragma once

#include <pthread.h>

#include <cstddef>
#include <functional>
#include <stdexcept>
#include <utility>

namespace tvx::test {

/// Bytes of stack that a request has.
#if defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__)
inline constexpr std::size_t REQUEST_STACK =
    1024 * 1024;  // the sanitizers' frames are several times larger
#else
inline constexpr std::size_t REQUEST_STACK = 256 * 1024;
#endif

/// A thread with no more stack than that. Its end is waited for; what the body throws ends the
/// process.
class Request_Thread {
 public:
  explicit Request_Thread(std::function<void()> body) : m_Body(std::move(body)) {
    pthread_attr_t attributes;
    pthread_attr_init(&attributes);
    const bool made = pthread_attr_setstacksize(&attributes, REQUEST_STACK) == 0 &&
                      pthread_create(
                          &m_Thread, &attributes,
                          [](void* self) -> void* {
                            static_cast<Request_Thread*>(self)->m_Body();
                            return nullptr;
                          },
                          this) == 0;
    pthread_attr_destroy(&attributes);
    if (!made) throw std::runtime_error("there is no thread");
  }
  ~Request_Thread() { pthread_join(m_Thread, nullptr); }
  Request_Thread(const Request_Thread&) = delete;
  Request_Thread& operator=(const Request_Thread&) = delete;

 private:
  std::function<void()> m_Body;
  pthread_t m_Thread{};
};

}  // namespace tvx::test
