// Tells on a terminal or in a log that something long is still going on.
#pragma once

#include <chrono>
#include <condition_variable>
#include <mutex>
#include <ostream>
#include <string>
#include <thread>

namespace tvx::host {

/// While it lives, writes `text` with the seconds that have passed, from a thread of its own: at
/// once and then in steps. On a terminal each line takes the place of the last one, and the last
/// one is wiped out at the end. Nothing else may write to the stream meanwhile.
class Progress {
 public:
  using Clock = std::chrono::steady_clock;

  Progress(std::ostream& out, std::string text, std::chrono::milliseconds step, bool terminal);
  ~Progress();
  Progress(const Progress&) = delete;
  Progress& operator=(const Progress&) = delete;

 private:
  void run();
  void show() const;

  std::ostream& m_Out;
  const std::string m_Text;
  const std::chrono::milliseconds m_Step;
  const bool m_bTerminal;
  const Clock::time_point m_Begin = Clock::now();

  std::mutex m_Mutex;
  std::condition_variable m_Wake;
  bool m_bDone = false;  ///< guarded by m_Mutex
  std::thread m_Thread;
};

}  // namespace tvx::host
