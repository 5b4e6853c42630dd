#include "http/Listener.h"

#include <arpa/inet.h>
#include <fmt/format.h>
#include <microhttpd.h>
#include <netinet/in.h>
#include <sys/socket.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <memory>
#include <new>
#include <optional>

#include "http/CimErrors.h"
#include "http/Deadlines.h"
#include "http/HttpRules.h"
#include "http/XmlText.h"

namespace tvx::host::http {
namespace {

/// One request while its body comes in.
struct Exchange {
  HttpHead head;
  std::string body;
  std::optional<MessageError> refusal;  ///< known before the body is there
};

struct Answer {
  unsigned status = MHD_HTTP_OK;
  std::string cimError;
  std::string body;
};

std::string lowerCase(const char* text) {
  std::string result(text == nullptr ? "" : text);
  std::transform(result.begin(), result.end(), result.begin(),
                 [](char c) { return c >= 'A' && c <= 'Z' ? static_cast<char>(c + 32) : c; });
  return result;
}

/// A field that is there several times is one with all the values.
MHD_Result keepField(void* fields, MHD_ValueKind, const char* name, const char* value) {
  auto& all = *static_cast<std::map<std::string, std::string>*>(fields);
  const auto [field, isNew] = all.try_emplace(lowerCase(name));
  field->second += (isNew ? "" : ", ") + std::string(value == nullptr ? "" : value);
  return MHD_YES;
}

int socketOf(MHD_Connection* connection) {
  const MHD_ConnectionInfo* info =
      MHD_get_connection_info(connection, MHD_CONNECTION_INFO_CONNECTION_FD);
  return info == nullptr ? -1 : info->connect_fd;
}

MHD_Result send(MHD_Connection* connection, const Answer& answer) {
  MHD_Response* response = MHD_create_response_from_buffer(
      answer.body.size(), const_cast<char*>(answer.body.data()), MHD_RESPMEM_MUST_COPY);
  if (response == nullptr) {
    return MHD_NO;
  }
  const auto field = [response](const char* name, const std::string& value) {
    MHD_add_response_header(response, name, value.c_str());
  };
  if (answer.status == MHD_HTTP_OK) {
    field("Content-Type", "application/xml; charset=\"utf-8\"");
    field("CIMOperation", "MethodResponse");
  } else {
    field("Content-Type", "text/plain; charset=\"utf-8\"");
    field("Connection", "close");
  }
  if (!answer.cimError.empty()) {
    field("CIMError", answer.cimError);
  }
  if (answer.status == MHD_HTTP_METHOD_NOT_ALLOWED) {
    field("Allow", "POST, M-POST");
  }
  const MHD_Result result = MHD_queue_response(connection, answer.status, response);
  MHD_destroy_response(response);
  return result;
}

Answer refusalAnswer(const MessageError& error) {
  return {error.status(), error.cimError(), std::string(error.what()) + "\n"};
}

}  // namespace

class Listener::Impl {
 public:
  Impl(const CimServer& server, ListenerOptions initial)
      : m_Server(server), m_Options(std::move(initial)), m_Deadlines(m_Options.clientLimit) {
    start();
  }
  ~Impl() { MHD_stop_daemon(m_Daemon); }
  Impl(const Impl&) = delete;
  Impl& operator=(const Impl&) = delete;

  std::uint16_t port() const {
    const MHD_DaemonInfo* info = MHD_get_daemon_info(m_Daemon, MHD_DAEMON_INFO_BIND_PORT);
    return info == nullptr ? m_Options.port : info->port;
  }

  std::string url() const {
    const bool six = m_Options.address.find(':') != std::string::npos;
    return fmt::format("http://{}{}{}:{}/cimom", six ? "[" : "", m_Options.address, six ? "]" : "",
                       port());
  }

 private:
  void start() {
    sockaddr_storage place{};
    const bool six = fillAddress(place);
    unsigned flags = MHD_USE_THREAD_PER_CONNECTION | MHD_USE_INTERNAL_POLLING_THREAD | MHD_USE_POLL;
    if (six) {
      flags |= MHD_USE_IPv6;
    }
    const auto seconds = static_cast<unsigned>(
        std::chrono::ceil<std::chrono::seconds>(m_Options.clientLimit).count());
    errno = 0;
    m_Daemon = MHD_start_daemon(
        flags, m_Options.port, nullptr, nullptr, &Impl::handle, this, MHD_OPTION_SOCK_ADDR,
        reinterpret_cast<sockaddr*>(&place), MHD_OPTION_CONNECTION_LIMIT, m_Options.connectionLimit,
        MHD_OPTION_CONNECTION_TIMEOUT, seconds * 2, MHD_OPTION_NOTIFY_COMPLETED, &Impl::completed,
        this, MHD_OPTION_NOTIFY_CONNECTION, &Impl::connected, this, MHD_OPTION_END);
    if (m_Daemon == nullptr) {
      const std::string reason = errno == 0 ? "no reason given" : std::strerror(errno);
      throw ListenError(fmt::format("cannot listen on {} port {}: {}", m_Options.address,
                                    m_Options.port, reason));
    }
  }

  /// True for an IPv6 address.
  bool fillAddress(sockaddr_storage& place) const {
    auto* four = reinterpret_cast<sockaddr_in*>(&place);
    if (inet_pton(AF_INET, m_Options.address.c_str(), &four->sin_addr) == 1) {
      four->sin_family = AF_INET;
      four->sin_port = htons(m_Options.port);
      return false;
    }
    auto* six = reinterpret_cast<sockaddr_in6*>(&place);
    if (inet_pton(AF_INET6, m_Options.address.c_str(), &six->sin6_addr) == 1) {
      six->sin6_family = AF_INET6;
      six->sin6_port = htons(m_Options.port);
      return true;
    }
    throw ListenError(fmt::format("'{}' is no IPv4 or IPv6 address", m_Options.address));
  }

  static void connected(void* self, MHD_Connection* connection, void** /*context*/,
                        MHD_ConnectionNotificationCode code) {
    Deadlines& deadlines = static_cast<Impl*>(self)->m_Deadlines;
    if (code == MHD_CONNECTION_NOTIFY_STARTED) {
      deadlines.add(socketOf(connection));
    } else {
      deadlines.remove(socketOf(connection));
    }
  }

  static void completed(void* self, MHD_Connection* connection, void** context,
                        MHD_RequestTerminationCode /*code*/) {
    delete static_cast<Exchange*>(*context);
    *context = nullptr;
    static_cast<Impl*>(self)->m_Deadlines.enter(socketOf(connection), Deadlines::Phase::Idle);
  }

  /// Called with the head, then with each piece of the body, then with none.
  static MHD_Result handle(void* self, MHD_Connection* connection, const char* url,
                           const char* method, const char* /*version*/, const char* data,
                           std::size_t* size, void** context) {
    try {
      auto* impl = static_cast<Impl*>(self);
      if (*context == nullptr) {
        return impl->begin(connection, url, method, context);
      }
      auto& exchange = *static_cast<Exchange*>(*context);
      return *size != 0 ? impl->take(exchange, data, *size) : impl->finish(connection, exchange);
    } catch (const std::exception&) {
      return MHD_NO;  // Out of memory: closes this connection, the others live on.
    }
  }

  MHD_Result begin(MHD_Connection* connection, const char* url, const char* method,
                   void** context) {
    auto exchange = std::make_unique<Exchange>();
    exchange->head.path = url;
    exchange->head.method = method;
    MHD_get_connection_values(connection, MHD_HEADER_KIND, &keepField, &exchange->head.fields);
    try {
      checkHead(exchange->head, m_Options.bodyLimit);
    } catch (const MessageError& error) {
      // Answered before the body is read: the library then closes the connection.
      *context = exchange.release();
      m_Deadlines.enter(socketOf(connection), Deadlines::Phase::Sending);
      return send(connection, refusalAnswer(error));
    }
    *context = exchange.release();
    m_Deadlines.enter(socketOf(connection), Deadlines::Phase::Reading);
    return MHD_YES;
  }

  MHD_Result take(Exchange& exchange, const char* data, std::size_t& size) {
    if (exchange.body.size() + size > m_Options.bodyLimit) {
      exchange.body.clear();
      exchange.refusal.emplace(
          MHD_HTTP_CONTENT_TOO_LARGE, "",
          fmt::format("the content is larger than {} bytes", m_Options.bodyLimit));
    }
    if (!exchange.refusal) {
      exchange.body.append(data, size);
    }
    size = 0;
    return MHD_YES;
  }

  MHD_Result finish(MHD_Connection* connection, Exchange& exchange) {
    m_Deadlines.enter(socketOf(connection), Deadlines::Phase::Working);
    const Answer answer = answerTo(exchange);
    m_Deadlines.enter(socketOf(connection), Deadlines::Phase::Sending);
    return send(connection, answer);
  }

  Answer answerTo(Exchange& exchange) const {
    try {
      if (exchange.refusal) {
        throw MessageError(*exchange.refusal);
      }
      const CimMessage message(std::move(exchange.body));
      checkAgainst(exchange.head, message);
      return {MHD_HTTP_OK, "", m_Server.answer(message, hostOf(exchange.head))};
    } catch (const MessageError& error) {
      return refusalAnswer(error);
    } catch (const std::bad_alloc&) {
      return {MHD_HTTP_INSUFFICIENT_STORAGE, "", "out of memory\n"};
    }
  }

  const CimServer& m_Server;
  const ListenerOptions m_Options;
  Deadlines m_Deadlines;
  MHD_Daemon* m_Daemon = nullptr;
};

Listener::Listener(const CimServer& server, ListenerOptions options)
    : m_Impl(std::make_unique<Impl>(server, std::move(options))) {}

Listener::~Listener() = default;

std::uint16_t Listener::port() const {
  return m_Impl->port();
}

std::string Listener::url() const {
  return m_Impl->url();
}

}  // namespace tvx::host::http
