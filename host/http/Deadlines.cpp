#include "http/Deadlines.h"

#include <sys/socket.h>

#include <algorithm>
#include <string_view>

namespace tvx::host::http {
namespace {

constexpr int sendingFactor = 10;
constexpr std::string_view timeoutAnswer =
    "HTTP/1.1 408 Request Timeout\r\nConnection: close\r\nContent-Length: 0\r\n\r\n";

}  // namespace

Deadlines::Deadlines(std::chrono::milliseconds limit)
    : m_Limit(limit), m_Thread([this] { watch(); }) {}

Deadlines::~Deadlines() {
  {
    const std::lock_guard lock(m_Mutex);
    m_bStop = true;
  }
  m_Wake.notify_all();
  m_Thread.join();
}

void Deadlines::add(int socket) {
  const std::lock_guard lock(m_Mutex);
  m_Entries[socket] = {Phase::Idle, Clock::now()};
}

void Deadlines::enter(int socket, Phase phase) {
  const std::lock_guard lock(m_Mutex);
  const auto found = m_Entries.find(socket);
  if (found != m_Entries.end()) {
    found->second = {phase, Clock::now()};
  }
}

void Deadlines::remove(int socket) {
  const std::lock_guard lock(m_Mutex);
  m_Entries.erase(socket);
}

void Deadlines::watch() {
  const auto step =
      std::clamp(m_Limit / 4, std::chrono::milliseconds(10), std::chrono::milliseconds(1000));
  std::unique_lock lock(m_Mutex);
  while (!m_Wake.wait_for(lock, step, [this] { return m_bStop; })) {
    endLate(Clock::now());
  }
}

bool Deadlines::isLate(const Entry& entry, Clock::time_point now) const {
  if (entry.phase == Phase::Working) {
    return false;
  }
  return now - entry.since > m_Limit * (entry.phase == Phase::Sending ? sendingFactor : 1);
}

void Deadlines::endLate(Clock::time_point now) {
  // Only shut down: the sockets stay open until their owner closes them, so that a number cannot
  // come to mean another connection.
  for (auto each = m_Entries.begin(); each != m_Entries.end();) {
    if (!isLate(each->second, now)) {
      ++each;
      continue;
    }
    if (each->second.phase == Phase::Reading) {
      send(each->first, timeoutAnswer.data(), timeoutAnswer.size(), MSG_NOSIGNAL | MSG_DONTWAIT);
    }
    shutdown(each->first, SHUT_RDWR);
    each = m_Entries.erase(each);
  }
}

}  // namespace tvx::host::http
