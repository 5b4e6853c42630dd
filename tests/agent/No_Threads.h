// A system that refuses new threads.
#pragma once

#include <pthread.h>

#include <cstddef>

namespace cimrt::test {

/// Gives new threads a stack that no machine has.
class No_Threads {
 public:
  No_Threads() {
    pthread_getattr_default_np(&m_Before);
    pthread_attr_t huge;
    pthread_getattr_default_np(&huge);
    pthread_attr_setstacksize(&huge, std::size_t{1} << 46);
    pthread_setattr_default_np(&huge);
    pthread_attr_destroy(&huge);
  }
  ~No_Threads() {
    pthread_setattr_default_np(&m_Before);
    pthread_attr_destroy(&m_Before);
  }
  No_Threads(const No_Threads&) = delete;
  No_Threads& operator=(const No_Threads&) = delete;

 private:
  pthread_attr_t m_Before;
};

}  // namespace cimrt::test
