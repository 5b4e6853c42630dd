#include "support/Loopback_Servers.h"

#include <arpa/inet.h>
#include <netinet/in.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cstdlib>
#include <cstring>

namespace tvx::test {

namespace {

constexpr int POLL_MS = 5;
constexpr int CLIENT_SECONDS = 5;

sockaddr_in loopback() {
  sockaddr_in address{};
  address.sin_family = AF_INET;
  address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
  return address;
}

/// A server thread never waits longer than this for a client.
void limitWaiting(int fd) {
  timeval limit{};
  limit.tv_sec = CLIENT_SECONDS;
  ::setsockopt(fd, SOL_SOCKET, SO_RCVTIMEO, &limit, sizeof limit);
  ::setsockopt(fd, SOL_SOCKET, SO_SNDTIMEO, &limit, sizeof limit);
}

Socket acceptFrom(const Socket& listener) {
  Socket client(::accept4(listener.fd(), nullptr, nullptr, SOCK_CLOEXEC));
  limitWaiting(client.fd());
  return client;
}

std::string authority(const char* scheme, int port) {
  return std::string(scheme) + "://127.0.0.1:" + std::to_string(port) + "/";
}

}  // namespace

Socket::~Socket() {
  if (m_Fd >= 0) ::close(m_Fd);
}

int Socket::port() const {
  sockaddr_in address{};
  socklen_t length = sizeof address;
  ::getsockname(m_Fd, reinterpret_cast<sockaddr*>(&address), &length);
  return ntohs(address.sin_port);
}

void Socket::send(const std::string& data) const {
  std::size_t sent = 0;
  while (sent < data.size()) {
    const ssize_t n = ::send(m_Fd, data.data() + sent, data.size() - sent, MSG_NOSIGNAL);
    if (n <= 0) return;
    sent += static_cast<std::size_t>(n);
  }
}

std::string Socket::line() const {
  std::string text;
  char c = 0;
  while (::recv(m_Fd, &c, 1, 0) == 1 && c != '\n')
    if (c != '\r') text += c;
  return text;
}

Socket Socket::bound(int type) {
  Socket socket(::socket(AF_INET, type | SOCK_CLOEXEC, 0));
  const sockaddr_in address = loopback();
  if (::bind(socket.fd(), reinterpret_cast<const sockaddr*>(&address), sizeof address) != 0)
    std::abort();
  if (type == SOCK_STREAM && ::listen(socket.fd(), 8) != 0) std::abort();
  return socket;
}

void Loopback_Server::put(const std::string& name, const std::string& content) {
  const std::lock_guard lock(m_Mutex);
  m_Files[name] = content;
}

std::string Loopback_Server::content(const std::string& name) const {
  const std::lock_guard lock(m_Mutex);
  const auto found = m_Files.find(name);
  return found != m_Files.end() ? found->second : std::string();
}

bool Loopback_Server::has(const std::string& name) const {
  const std::lock_guard lock(m_Mutex);
  return m_Files.count(name) != 0;
}

std::vector<std::string> Loopback_Server::requests() const {
  const std::lock_guard lock(m_Mutex);
  return m_Requests;
}

void Loopback_Server::note(const std::string& request) {
  const std::lock_guard lock(m_Mutex);
  m_Requests.push_back(request);
}

void Loopback_Server::start(void (*serve)(Loopback_Server& self)) {
  m_Thread = std::thread([this, serve] { serve(*this); });
}

void Loopback_Server::stop() {
  m_bStopping = true;
  m_Thread.join();
}

bool Loopback_Server::awaitInput(int fd) const {
  pollfd waiting{fd, POLLIN, 0};
  while (!m_bStopping)
    if (::poll(&waiting, 1, POLL_MS) > 0) return true;
  return false;
}

// ---- HTTP ----

Http_Server::Http_Server() : Loopback_Server(SOCK_STREAM) {
  start(serve);
}

std::string Http_Server::url(const std::string& name) const {
  return authority("http", port()) + name;
}

void Http_Server::serve(Loopback_Server& self) {
  auto& server = static_cast<Http_Server&>(self);
  while (server.awaitInput(server.m_Socket.fd())) server.serveOne(acceptFrom(server.m_Socket));
}

void Http_Server::receive(const Socket& client, const std::string& name, std::size_t length) {
  std::string body(length, '\0');
  std::size_t got = 0;
  while (got < length) {
    const ssize_t n = ::recv(client.fd(), body.data() + got, length - got, 0);
    if (n <= 0) break;
    got += static_cast<std::size_t>(n);
  }
  body.resize(got);
  put(name, body);
  client.send("HTTP/1.1 201 Created\r\nContent-Length: 0\r\nConnection: close\r\n\r\n");
}

void Http_Server::serveOne(const Socket& client) {
  const std::string request = client.line();
  std::size_t length = 0;
  bool continues = false;
  for (std::string header = client.line(); !header.empty(); header = client.line()) {
    note(header);
    if (header.rfind("Content-Length: ", 0) == 0) length = std::strtoul(&header[16], nullptr, 10);
    continues = continues || header.rfind("Expect: 100", 0) == 0;
  }
  note(request);
  const std::size_t start = request.find('/') + 1;
  const std::string name = request.substr(start, request.rfind(' ') - start);
  if (continues) client.send("HTTP/1.1 100 Continue\r\n\r\n");
  if (request.rfind("PUT ", 0) == 0) return receive(client, name, length);
  const std::string body = has(name) ? content(name) : "not found";
  client.send(std::string(has(name) ? "HTTP/1.1 200 OK" : "HTTP/1.1 404 Not Found") +
              "\r\nContent-Length: " + std::to_string(body.size()) +
              "\r\nConnection: close\r\n\r\n" + body.substr(0, cutAfter));
}

// ---- TFTP ----

namespace {

constexpr std::size_t TFTP_BLOCK = 512;
enum Tftp_Operation : char { TFTP_READ = 1, TFTP_DATA = 3, TFTP_ERROR = 5 };

std::string tftpHead(char operation, std::size_t number) {
  return {'\0', operation, static_cast<char>(number >> 8), static_cast<char>(number & 0xFF)};
}

}  // namespace

Tftp_Server::Tftp_Server() : Loopback_Server(SOCK_DGRAM) {
  start(serve);
}

std::string Tftp_Server::url(const std::string& name) const {
  return authority("tftp", port()) + name;
}

void Tftp_Server::serve(Loopback_Server& self) {
  auto& server = static_cast<Tftp_Server&>(self);
  while (server.awaitInput(server.m_Socket.fd())) {
    std::array<char, 1024> packet{};
    sockaddr_in peer{};
    socklen_t length = sizeof peer;
    const ssize_t n = ::recvfrom(server.m_Socket.fd(), packet.data(), packet.size() - 1, 0,
                                 reinterpret_cast<sockaddr*>(&peer), &length);
    if (n > 2 && packet[1] == TFTP_READ) server.sendFile(&packet[2], &peer, length);
  }
}

void Tftp_Server::sendFile(const std::string& name, const void* peer, unsigned length) {
  note(name);
  const Socket transfer = Socket::bound(SOCK_DGRAM);
  limitWaiting(transfer.fd());
  if (::connect(transfer.fd(), static_cast<const sockaddr*>(peer), length) != 0) return;
  if (!has(name)) return transfer.send(tftpHead(TFTP_ERROR, 1) + std::string("not found", 10));
  const std::string file = content(name);
  for (std::size_t block = 0; block <= file.size() / TFTP_BLOCK; block++) {
    transfer.send(tftpHead(TFTP_DATA, block + 1) + file.substr(block * TFTP_BLOCK, TFTP_BLOCK));
    std::array<char, 64> acknowledged{};
    if (::recv(transfer.fd(), acknowledged.data(), acknowledged.size(), 0) <= 0) return;
  }
}

// ---- FTP ----

Ftp_Server::Ftp_Server() : Loopback_Server(SOCK_STREAM) {
  start(serve);
}

std::string Ftp_Server::url(const std::string& name) const {
  return authority("ftp", port()) + name;
}

void Ftp_Server::serve(Loopback_Server& self) {
  auto& server = static_cast<Ftp_Server&>(self);
  while (server.awaitInput(server.m_Socket.fd())) server.serveOne(acceptFrom(server.m_Socket));
}

void Ftp_Server::serveOne(const Socket& client) {
  const Socket data = Socket::bound(SOCK_STREAM);
  client.send("220 ready\r\n");
  for (std::string request = client.line(); !request.empty(); request = client.line()) {
    note(request);
    const std::string verb = request.substr(0, request.find(' '));
    const std::string name = request.size() > 5 ? request.substr(5) : "";
    if (verb == "USER") {
      client.send("230 welcome\r\n");
    } else if (verb == "PWD") {
      client.send("257 \"/\"\r\n");
    } else if (verb == "EPSV") {
      client.send("229 Entering (|||" + std::to_string(data.port()) + "|)\r\n");
    } else if (verb == "TYPE") {
      client.send("200 fine\r\n");
    } else if (verb == "RETR" && has(name)) {
      client.send("150 coming\r\n");
      acceptFrom(data).send(content(name));
      client.send("226 done\r\n");
    } else if (verb == "RETR") {
      client.send("550 not found\r\n");
    } else {
      client.send("502 unknown\r\n");
    }
  }
}

}  // namespace tvx::test
