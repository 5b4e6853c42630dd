// The HTTP side: takes connections and hands messages to the CIM server.
#pragma once

#include <chrono>
#include <cstdint>
#include <memory>
#include <stdexcept>
#include <string>

#include "http/CimServer.h"

namespace tvx::host::http {

struct ListenerOptions {
  std::string address = "127.0.0.1";  ///< IPv4 or IPv6 address to listen on
  std::uint16_t port = 5988;          ///< 0 for any free one
  std::size_t bodyLimit = 64u << 20;  ///< bytes of one message
  /// How long a client may take for a message, and how long a connection may rest.
  std::chrono::milliseconds clientLimit{30000};
  unsigned connectionLimit = 64;
};

/// The listener cannot be started; the message tells why.
class ListenError : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
};

/// Listens from construction to destruction, each connection on a thread of its own.
class Listener {
 public:
  /// `server` must outlive the listener. Throws ListenError.
  Listener(const CimServer& server, ListenerOptions options);
  /// Closes the port and waits until requests under way have been answered.
  ~Listener();
  Listener(const Listener&) = delete;
  Listener& operator=(const Listener&) = delete;

  /// The port, also if any free one was asked for.
  std::uint16_t port() const;
  /// "http://127.0.0.1:5988/cimom".
  std::string url() const;

  class Impl;

 private:
  std::unique_ptr<Impl> m_Impl;
};

}  // namespace tvx::host::http
