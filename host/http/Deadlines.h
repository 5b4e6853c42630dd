// Ends the connections of clients that take too long.
#pragma once

#include <chrono>
#include <condition_variable>
#include <map>
#include <mutex>
#include <thread>

namespace tvx::host::http {

/// Watches open connections on a thread of its own. A limit counts from the start of a phase, so
/// that a client that sends a byte now and then runs into it too. Thread safe.
class Deadlines {
 public:
  enum class Phase {
    Idle,     ///< no request, or its head is on the way: closed after the limit
    Reading,  ///< the body is on the way: answered with 408 and closed after the limit
    Working,  ///< the server's own time: no limit
    Sending,  ///< the client takes the answer: closed after ten times the limit
  };

  explicit Deadlines(std::chrono::milliseconds limit);
  ~Deadlines();
  Deadlines(const Deadlines&) = delete;
  Deadlines& operator=(const Deadlines&) = delete;

  /// A new connection in phase Idle. The socket stays the caller's, who calls `remove` before it
  /// closes it.
  void add(int socket);
  void enter(int socket, Phase phase);
  void remove(int socket);

 private:
  using Clock = std::chrono::steady_clock;
  struct Entry {
    Phase phase;
    Clock::time_point since;
  };

  void watch();
  void endLate(Clock::time_point now);
  bool isLate(const Entry& entry, Clock::time_point now) const;

  const std::chrono::milliseconds m_Limit;
  std::mutex m_Mutex;
  std::condition_variable m_Wake;
  std::map<int, Entry> m_Entries;  ///< by socket; guarded by m_Mutex
  bool m_bStop = false;            ///< guarded by m_Mutex
  std::thread m_Thread;            ///< last, so that it sees the other members made
};

}  // namespace tvx::host::http
