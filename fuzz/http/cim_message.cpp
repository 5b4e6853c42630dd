// Any body either is refused with an HTTP status, or gets an answer that is XML.
#include <pugixml.hpp>
#include <string>

#include "../runtime/Expect.h"
#include "Test_Classes.h"
#include "http/CimErrors.h"
#include "http/CimServer.h"

using namespace tvx::host;

namespace {

/// A broker without a provider: every request is read whole and then refused.
Broker& emptyBroker() {
  static BrokerOptions options = [] {
    BrokerOptions result;
    result.classes = &test::testClasses();
    result.nameSpace = "root/fake";
    return result;
  }();
  static Broker broker(options);
  return broker;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  static const http::CimServer server(emptyBroker(), test::testClasses());
  try {
    const http::CimMessage message(std::string(reinterpret_cast<const char*>(data), size));
    const std::string answer = server.answer(message, "here");
    pugi::xml_document document;
    const bool isXml = document.load_buffer(answer.data(), answer.size());
    cimrt::fuzz::expect(isXml);
  } catch (const http::MessageError& error) {
    cimrt::fuzz::expect(error.status() == 400 || error.status() == 501);
  }
  return 0;
}
