// A client that sends exactly the bytes that a test wants, right or wrong.
#pragma once

#include <arpa/inet.h>
#include <netinet/in.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cstdint>
#include <string>
#include <string_view>

namespace tvx::host::test {

/// One connection to a port of this machine.
class RawClient {
 public:
  /// `receiveBuffer`: bytes that the system takes in for it before it is read; 0 leaves the usual.
  explicit RawClient(std::uint16_t port, int receiveBuffer = 0)
      : m_Socket(socket(AF_INET, SOCK_STREAM, 0)) {
    if (receiveBuffer != 0) {
      setsockopt(m_Socket, SOL_SOCKET, SO_RCVBUF, &receiveBuffer, sizeof receiveBuffer);
    }
    sockaddr_in place{};
    place.sin_family = AF_INET;
    place.sin_port = htons(port);
    place.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    m_bOpen = connect(m_Socket, reinterpret_cast<sockaddr*>(&place), sizeof place) == 0;
  }
  ~RawClient() { close(m_Socket); }
  RawClient(const RawClient&) = delete;
  RawClient& operator=(const RawClient&) = delete;

  bool isOpen() const { return m_bOpen; }

  /// False once the other side has closed.
  bool send(std::string_view bytes) {
    while (!bytes.empty()) {
      const ssize_t sent = ::send(m_Socket, bytes.data(), bytes.size(), MSG_NOSIGNAL);
      if (sent <= 0) {
        return false;
      }
      bytes.remove_prefix(static_cast<std::size_t>(sent));
    }
    return true;
  }

  /// One whole answer, or what came until the other side closed or five seconds passed.
  std::string receive() {
    std::string answer;
    while (!isWhole(answer)) {
      pollfd ready{m_Socket, POLLIN, 0};
      char buffer[65536];
      const ssize_t count =
          poll(&ready, 1, 5000) == 1 ? recv(m_Socket, buffer, sizeof buffer, 0) : -1;
      if (count <= 0) {
        break;
      }
      answer.append(buffer, static_cast<std::size_t>(count));
    }
    return answer;
  }

 private:
  static bool isWhole(const std::string& answer) {
    const std::size_t end = answer.find("\r\n\r\n");
    const std::size_t field = answer.find("Content-Length: ");
    if (end == std::string::npos || field == std::string::npos || field > end) {
      return false;
    }
    return answer.size() >= end + 4 + std::stoul(answer.substr(field + 16));
  }

  int m_Socket;
  bool m_bOpen = false;
};

/// Head of a request for an operation in root/fake.
inline std::string requestHead(std::size_t length, const std::string& more = "") {
  return "POST /cimom HTTP/1.1\r\nHost: here:1\r\nContent-Type: application/xml\r\n"
         "CIMOperation: MethodCall\r\n" +
         more + "Content-Length: " + std::to_string(length) + "\r\n\r\n";
}

inline std::string frame(const std::string& call) {
  return "<?xml version=\"1.0\" encoding=\"utf-8\"?><CIM CIMVERSION=\"2.0\" DTDVERSION=\"2.0\">"
         "<MESSAGE ID=\"7\" PROTOCOLVERSION=\"1.0\"><SIMPLEREQ>" +
         call + "</SIMPLEREQ></MESSAGE></CIM>";
}

inline std::string operation(const std::string& name, const std::string& parameters) {
  return frame("<IMETHODCALL NAME=\"" + name +
               "\"><LOCALNAMESPACEPATH><NAMESPACE NAME=\"root\"/><NAMESPACE NAME=\"fake\"/>"
               "</LOCALNAMESPACEPATH>" +
               parameters + "</IMETHODCALL>");
}

inline std::string parameter(const std::string& name, const std::string& content) {
  return "<IPARAMVALUE NAME=\"" + name + "\">" + content + "</IPARAMVALUE>";
}

inline std::string valueParameter(const std::string& name, const std::string& text) {
  return parameter(name, "<VALUE>" + text + "</VALUE>");
}

inline std::string classParameter(const std::string& className) {
  return parameter("ClassName", "<CLASSNAME NAME=\"" + className + "\"/>");
}

/// INSTANCENAME of a widget; `name` is XML text.
inline std::string widgetName(const std::string& name, unsigned number,
                              const std::string& className = "FAKE_Widget") {
  return "<INSTANCENAME CLASSNAME=\"" + className +
         "\"><KEYBINDING NAME=\"Name\"><KEYVALUE VALUETYPE=\"string\">" + name +
         "</KEYVALUE></KEYBINDING><KEYBINDING NAME=\"Number\"><KEYVALUE VALUETYPE=\"numeric\">" +
         std::to_string(number) + "</KEYVALUE></KEYBINDING></INSTANCENAME>";
}

/// The widget whose name has quotes, blanks, a colon and a backslash.
inline const char* const oddName = "wid get: &quot;1&quot;\\";

}  // namespace tvx::host::test
