// Methods of a service, called as the dispatcher calls them, on a simulated host of two ports.
#pragma once

#include <string>

#include "../agent/Agent_Fixture.h"
#include "../agent/Instance_Checks.h"
#include "access/TVX_MethodWrapper.h"
#include "common/TVX_Clock.h"
#include "common/TVX_Memory.h"
#include "tvxsim/tvxsim.h"

namespace cimrt::test {

class Service_Test : public Agent_Test {
 protected:
  static constexpr const char* PORT = "10000000000000A1";
  static constexpr const char* OTHER_PORT = "10000000000000A2";

  /// The host with more members for its first port, such as `"boot_code_enabled": true`.
  ProviderAgent& build(const std::string& members = {}) {
    agent = &builtAgent(R"({"cards": [{"serial_number": "S1", "ports": [
        {"wwpn": "10000000000000A1", "wwnn": "20000000000000A1")" +
                        (members.empty() ? "" : ", " + members) +
                        R"(}, {"wwpn": "10000000000000A2", "wwnn": "20000000000000A2"}]}]})");
    log.clear();
    tvxsim_forget_calls();
    return *agent;
  }
  void TearDown() override {
    tvxSetSleep(nullptr);
    if (agent) awaitIdle(*agent);
    Agent_Test::TearDown();
  }

  TVXHBA_FCPort* port(std::size_t i = 0) { return agent->m_TVXHBA_FCPort_map[i]; }
  /// A path to a port that the agent need not have.
  static Ref<TVXHBA_FCPort> pathTo(const char* deviceID) {
    Ref<TVXHBA_FCPort> path(TVXHBA_FCPort::create());
    path->DeviceID.set(deviceID);
    return path;
  }
  /// The key values of a service that the agent does not have.
  template <class T>
  static Ref<T> stranger() {
    Ref<T> service(T::create());
    service->Name.set("another service");
    return service;
  }

  ProviderAgent* agent = nullptr;
  Property<std::uint32_t> result{};
};

}  // namespace cimrt::test
