// The management profiles that a port and its controller conform to.
#include "agent/Associations.h"
#include "agent/MapSteps.h"
#include "agent/Map_Insert.h"
#include "agent/RegisteredProfiles.h"

namespace cimrt {

namespace {

/// A profile, and the end of the text under which the conformance is logged.
struct Conformance {
  const char* text;
  const char* profile;
};

constexpr Conformance PORT_CONFORMANCES[] = {
    {"Physical Package", "Physical Package"},
    {"Host Discovered Resource", "Host Discovered Resources"},
    {"FC Initiator Port", "FC Initiator Ports"},
    {"Access Points", "Access Points"},
};

constexpr Conformance CONTROLLER_CONFORMANCES[] = {
    {"Storage HBA", "Storage HBA"},
    {"FC HBA", "FC HBA"},
};

std::string conformanceText(const char* element, const Port_Build& build, const Conformance& row) {
  return formatText("%s %s:%s, %s", element, build.adapter.attributes.Model.c_str(),
                    build.port.m_Name.c_str(), row.text);
}

}  // namespace

std::int32_t conformFCPort(Port_Build& build) {
  ProviderAgent& agent = build.adapter.host.agent;
  for (const Conformance& row : PORT_CONFORMANCES)
    createFCPortConformsToProfile(agent, conformanceText("FC Port", build, row),
                                  findRegisteredProfile(agent, row.profile), build.fcPort);
  return 0;
}

std::int32_t conformPortController(Port_Build& build) {
  ProviderAgent& agent = build.adapter.host.agent;
  for (const Conformance& row : CONTROLLER_CONFORMANCES)
    createPortControllerConformsToProfile(agent, conformanceText("Port Controller", build, row),
                                          findRegisteredProfile(agent, row.profile),
                                          build.controller);
  return 0;
}

}  // namespace cimrt
