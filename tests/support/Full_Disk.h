// What a full disk does, without a disk.
#pragma once

#include <sys/resource.h>

#include <csignal>

namespace tvx::test {

/// Files of this process can't grow beyond so many bytes while it lives.
class Full_Disk {
 public:
  explicit Full_Disk(rlim_t bytes) : m_Handler(std::signal(SIGXFSZ, SIG_IGN)) {
    ::getrlimit(RLIMIT_FSIZE, &m_Before);
    const rlimit limit{bytes, m_Before.rlim_max};
    ::setrlimit(RLIMIT_FSIZE, &limit);
  }
  ~Full_Disk() {
    ::setrlimit(RLIMIT_FSIZE, &m_Before);
    std::signal(SIGXFSZ, m_Handler);
  }
  Full_Disk(const Full_Disk&) = delete;
  Full_Disk& operator=(const Full_Disk&) = delete;

 private:
  rlimit m_Before{};
  void (*m_Handler)(int);
};

}  // namespace tvx::test
