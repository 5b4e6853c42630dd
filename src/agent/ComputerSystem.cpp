// The system that hosts every other instance: the platform's, or one made from what the host says
// of itself.
#include <netdb.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>

#include "agent/MapSteps.h"
#include "agent/Map_Insert.h"
#include "agent/Platform.h"

namespace cimrt {

namespace {

constexpr std::size_t HOST_NAME_SIZE = 512;
constexpr const char* UNKNOWN = "unknown";

/// An IPv4 address as text; an address of another family has none.
std::string addressText(const hostent& host) {
  if (host.h_addrtype != AF_INET || host.h_length != 4 || !host.h_addr_list[0]) return UNKNOWN;
  unsigned char bytes[4];
  std::memcpy(bytes, host.h_addr_list[0], sizeof bytes);
  return formatText("%d.%d.%d.%d", bytes[0], bytes[1], bytes[2], bytes[3]);
}

/// Host name and address into the agent; "unknown" for what cannot be found.
void findHost(ProviderAgent& agent) {
  agent.m_HostName = UNKNOWN;
  agent.m_IPAddress = UNKNOWN;
  char name[HOST_NAME_SIZE] = {};
  if (gethostname(name, sizeof name - 1) != 0) {
    TVX_LOG(TVX_ERR,
            "Error! gethostname() failed err : %d , using 'unknown' for hostname and IP address",
            errno);
    return;
  }
  agent.m_HostName = name;
  const hostent* host = gethostbyname(name);
  if (!host) {
    TVX_LOG(TVX_ERR, "Error! gethostbyname() failed, using 'unknown' for IP address.");
    return;
  }
  if (host->h_name) agent.m_HostName = host->h_name;
  agent.m_IPAddress = addressText(*host);
}

void describeHost(const ProviderAgent& agent, CIM_ComputerSystem& system) {
  system.OtherIdentifyingInfo.set(
      {agent.m_IPAddress.c_str(), agent.m_OSName.c_str(), agent.m_OSExtendedInfo.c_str()});
  system.IdentifyingDescriptions.set(
      {"TORVEX:IP_ADDRESS", "TORVEX:OS_NAME", "TORVEX:OS_EXTENDED_INFO"});
  system.Description.set(formatText("%s with Torvex CMPI HBA Provider v%d.%d.%d-%d",
                                    agent.m_OSName.c_str(), PROVIDER_MAJOR, PROVIDER_MINOR,
                                    PROVIDER_REVISION, PROVIDER_BUILD)
                             .c_str());
}

Ref<CIM_ComputerSystem> generateSystem(ProviderAgent& agent) {
  findHost(agent);
  TVX_LOG(TVX_DBG, "Generating an torvex specific m_CIM_ComputerSystem_map[0]");
  Ref<CIM_ComputerSystem> system = makeInstance<CIM_ComputerSystem>();
  system->Name.set(agent.m_HostName.c_str());
  system->ElementName.set(agent.m_HostName.c_str());
  system->CreationClassName.set("CIM_ComputerSystem");
  describeHost(agent, *system.get());
  system->EnabledState.set(0);
  system->RequestedState.set(12);
  system->TransitioningToState.set(12);
  system->EnabledDefault.set(2);
  system->Dedicated.set({0});
  system->NameFormat.set("Other");
  system->ResetCapability.set(2);
  system->PowerManagementCapabilities.set({0});
  system->OperationalStatus.set({2});
  agent.m_bOwnComputerSystem = true;
  return system;
}

Ref<CIM_ComputerSystem> findPlatformSystem() {
  TVX_LOG(TVX_DBG, "up-call to enumerate CIM_ComputerSystem started");
  Ref<CIM_ComputerSystem> system =
      findOnPlatform<CIM_ComputerSystem>(&IBMSD_ComputerSystem::static_meta_class);
  if (!system) TVX_LOG(TVX_DBG, "up-call method failed");
  return system;
}

}  // namespace

std::int32_t buildComputerSystem(Host_Build& host) {
  Ref<CIM_ComputerSystem> system = findPlatformSystem();
  if (!system) system = generateSystem(host.agent);
  TVX_LOG(TVX_DBG, "All clear -created tvxhba computer system instance");
  host.system = insertInto(host.agent.m_CIM_ComputerSystem_map, std::move(system),
                           "Insert Failed : m_TVXHBA_ComputerSystem_map");
  if (host.system) return 0;
  TVX_LOG(TVX_CRIT, "Could not create the Computer System Instance");
  return MAP_BUILD_FAILED;
}

}  // namespace cimrt
