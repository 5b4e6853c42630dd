// Small file servers on 127.0.0.1, each on a thread of its own, for one test.
#pragma once

#include <atomic>
#include <map>
#include <mutex>
#include <string>
#include <thread>
#include <vector>

namespace tvx::test {

/// A socket that closes itself.
class Socket {
 public:
  explicit Socket(int fd = -1) : m_Fd(fd) {}
  Socket(Socket&& other) noexcept : m_Fd(other.m_Fd) { other.m_Fd = -1; }
  ~Socket();
  Socket(const Socket&) = delete;
  Socket& operator=(const Socket&) = delete;

  int fd() const { return m_Fd; }
  /// Port that it is bound to.
  int port() const;
  void send(const std::string& data) const;
  /// The next line without its end; empty at the end of the stream.
  std::string line() const;

  /// A bound socket of SOCK_STREAM (listening) or SOCK_DGRAM on a free port of 127.0.0.1.
  static Socket bound(int type);

 private:
  int m_Fd;
};

/// What the servers have in common: files by name, and the requests that came.
class Loopback_Server {
 public:
  void put(const std::string& name, const std::string& content);
  std::string content(const std::string& name) const;
  std::vector<std::string> requests() const;
  int port() const { return m_Socket.port(); }

 protected:
  explicit Loopback_Server(int type) : m_Socket(Socket::bound(type)) {}
  ~Loopback_Server() = default;
  /// Starts and ends the thread; called by the first and last line of the concrete class's life.
  void start(void (*serve)(Loopback_Server& self));
  void stop();
  /// Waits for something to read; false when the server is to end.
  bool awaitInput(int fd) const;
  void note(const std::string& request);
  bool has(const std::string& name) const;

  Socket m_Socket;

 private:
  mutable std::mutex m_Mutex;
  std::map<std::string, std::string> m_Files;
  std::vector<std::string> m_Requests;
  std::atomic<bool> m_bStopping{false};
  std::thread m_Thread;
};

/// GET and PUT. Unknown names are answered 404 with a short body.
class Http_Server : public Loopback_Server {
 public:
  Http_Server();
  ~Http_Server() { stop(); }
  std::string url(const std::string& name) const;
  /// So many bytes of a file are sent, then the connection is closed.
  std::atomic<std::size_t> cutAfter{static_cast<std::size_t>(-1)};

 private:
  static void serve(Loopback_Server& self);
  void serveOne(const Socket& client);
  void receive(const Socket& client, const std::string& name, std::size_t length);
};

/// Reading alone.
class Tftp_Server : public Loopback_Server {
 public:
  Tftp_Server();
  ~Tftp_Server() { stop(); }
  std::string url(const std::string& name) const;

 private:
  static void serve(Loopback_Server& self);
  void sendFile(const std::string& name, const void* peer, unsigned length);
};

/// Reading alone, passive mode, anybody may log in.
class Ftp_Server : public Loopback_Server {
 public:
  Ftp_Server();
  ~Ftp_Server() { stop(); }
  std::string url(const std::string& name) const;

 private:
  static void serve(Loopback_Server& self);
  void serveOne(const Socket& client);
};

}  // namespace tvx::test
