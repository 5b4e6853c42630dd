#include "cli/Progress.h"

#include <utility>

namespace tvx::host {

Progress::Progress(std::ostream& out, std::string text, std::chrono::milliseconds step,
                   bool terminal)
    : m_Out(out), m_Text(std::move(text)), m_Step(step), m_bTerminal(terminal) {
  m_Thread = std::thread([this] { run(); });
}

Progress::~Progress() {
  {
    const std::lock_guard lock(m_Mutex);
    m_bDone = true;
  }
  m_Wake.notify_one();
  m_Thread.join();
  if (m_bTerminal) {
    m_Out << "\r\x1b[K" << std::flush;
  }
}

void Progress::show() const {
  const auto seconds = std::chrono::duration_cast<std::chrono::seconds>(Clock::now() - m_Begin);
  m_Out << (m_bTerminal ? "\r" : "") << m_Text << ", " << seconds.count() << " s"
        << (m_bTerminal ? "" : "\n") << std::flush;
}

void Progress::run() {
  std::unique_lock lock(m_Mutex);
  do {
    show();
  } while (!m_Wake.wait_for(lock, m_Step, [this] { return m_bDone; }));
}

}  // namespace tvx::host
