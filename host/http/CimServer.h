// The operations of a CIM server over the broker: from a request message to a response message.
#pragma once

#include <functional>
#include <string>

#include "Broker.h"
#include "cim/ClassCatalogue.h"
#include "http/CimMessage.h"

namespace tvx::host::http {

/// Answers messages. Holds no state of its own, so that any number of threads may use one.
class CimServer {
 public:
  /// Gets the accounts of each request that reached a provider; called on many threads at once.
  using Accountant = std::function<void(const ScopeReport&)>;

  /// Both must outlive the server.
  CimServer(Broker& broker, const ClassCatalogue& classes, Accountant accountant = {})
      : m_Broker(broker), m_Classes(classes), m_Accountant(std::move(accountant)) {}

  /// The response to a message: results, or an ERROR element. `host` is this server's name in
  /// paths. Throws MessageError for a message whose parameters have no valid form.
  std::string answer(const CimMessage& message, const std::string& host) const;

 private:
  Broker& m_Broker;
  const ClassCatalogue& m_Classes;
  Accountant m_Accountant;
};

}  // namespace tvx::host::http
