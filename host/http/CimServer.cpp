#include "http/CimServer.h"

#include <fmt/format.h>

#include "cim/TypeNames.h"
#include "http/CimErrors.h"
#include "http/OperationCall.h"
#include "http/XmlText.h"

namespace tvx::host::http {
namespace {

std::string messageStart(const CimMessage& message, const char* element) {
  std::string out =
      "<?xml version=\"1.0\" encoding=\"utf-8\"?>\n<CIM CIMVERSION=\"2.0\" "
      "DTDVERSION=\"2.0\"><MESSAGE";
  appendAttribute(out, "ID", message.id());
  out += fmt::format(" PROTOCOLVERSION=\"1.0\"><SIMPLERSP><{}", element);
  appendAttribute(out, "NAME", message.name());
  return out + ">";
}

std::string messageEnd(const char* element) {
  return fmt::format("</{}></SIMPLERSP></MESSAGE></CIM>\n", element);
}

/// Status codes of CIM end at 17; CMPI numbers its own from there on.
std::string errorElement(int rc, std::string_view text) {
  constexpr int lastShared = CMPI_RC_ERR_METHOD_NOT_FOUND;
  const bool shared = rc >= CMPI_RC_ERR_FAILED && rc <= lastShared;
  std::string out = "<ERROR";
  appendAttribute(out, "CODE", std::to_string(shared ? rc : CMPI_RC_ERR_FAILED));
  appendAttribute(out, "DESCRIPTION", text.empty() ? std::string_view(rcWords(rc)) : text);
  return out + "/>";
}

}  // namespace

std::string CimServer::answer(const CimMessage& message, const std::string& host) const {
  const char* element = message.isIntrinsic() ? "IMETHODRESPONSE" : "METHODRESPONSE";
  std::string out = messageStart(message, element);
  try {
    out += OperationCall(m_Broker, m_Classes, m_Accountant, message, host).run();
  } catch (const CimError& error) {
    out += errorElement(error.code(), error.what());
  } catch (const MessageError&) {
    throw;
  } catch (const std::exception& error) {
    out += errorElement(CMPI_RC_ERR_FAILED, error.what());
  }
  return out + messageEnd(element);
}

}  // namespace tvx::host::http
