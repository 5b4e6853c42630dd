// What the builders of the SAN maps hand on to one another, and the steps they are made of.
//
// `updateSANMaps` walks the targets of the device tree. Each logical unit becomes a target endpoint
// with its hosted access point, and a device of the class that its device type selects with its
// system device and its path. All pointers are to entries of the agent's maps (owned by the maps)
// or into the device tree, and hold for the length of one build. Everything here runs on the
// refresh thread with the agent's map and data locks held.
//
// There may be a hundred thousand units: what their instances have in common is kept once. Texts
// share their characters, and associations share the clones at their ends. A reader never sees the
// difference, because what it gets is a clone of its own, ends included.
#pragma once

#include <cstddef>
#include <set>
#include <string>
#include <utility>
#include <vector>

#include "agent/MapBuild.h"
#include "agent/SanTexts.h"

namespace cimrt {

/// The clone that all associations with an instance at one of their ends share.
class Shared_End {
 public:
  /// The clone, made when first asked for; owned here and by the associations. `instance`, not
  /// null, is the same each time.
  Instance* of(const Instance* instance) {
    if (!m_Clone) m_Clone.reset(clone(instance));
    return m_Clone.get();
  }

 private:
  Ref<Instance> m_Clone;
};

/// Constant texts, each kept once however many instances carry it.
class Constant_Texts {
 public:
  /// The text of a literal, told from others by its address.
  String operator[](const char* literal) {
    for (const auto& [known, text] : m_Texts)
      if (known == literal) return text;
    return m_Texts.emplace_back(literal, String(literal)).second;
  }

 private:
  std::vector<std::pair<const char*, String>> m_Texts;
};

/// A text that is mostly the same from one unit to the next.
class Repeated_Text {
 public:
  String operator()(const std::string& text) {
    if (!m_Last.equal(text.c_str())) m_Last = String(text.c_str());
    return m_Last;
  }

 private:
  String m_Last;
};

/// What all logical units of the host share.
struct San_Build {
  ProviderAgent& agent;
  CIM_ComputerSystem* system = nullptr;  ///< entry 0 of its map; null if that is empty
  /// Port WWPN, "|" and target WWPN of every remote port behind every port, each once.
  std::set<std::string> portTargets{};
  Shared_End systemEnd{};
  Constant_Texts constants{};
};

/// One FC port and what lies behind it.
struct San_Port_Build {
  San_Build& san;
  FCPort& port;
  TVXHBA_SCSIProtocolInitiatorEndpoint* initiator = nullptr;
  Shared_End initiatorEnd{};
  Repeated_Text targetWWPN{};
  Repeated_Text targetWWNN{};
  Repeated_Text model{};
};

/// One logical unit.
struct San_Unit_Build {
  San_Port_Build& port;
  const Target& target;
  std::size_t index;  ///< position among the port's targets
  Unit_Texts texts;
  TVXHBA_SCSIProtocolEndpoint* endpoint = nullptr;
  Shared_End endpointEnd{};
  // What both the endpoint and the device carry.
  String description{texts.description.c_str()};
  String osDeviceName{target.osDeviceName.c_str()};
};

// The steps, by topic. Each answers 0, or MAP_BUILD_FAILED to end the whole build with the maps as
// far as they got. The tables in SanMaps.cpp give their order.

// --- Endpoints (SanEndpoints.cpp)

/// Finds the endpoint that the adapter maps hold for the port; a port without one ends the build.
std::int32_t findInitiatorEndpoint(San_Port_Build& build);
/// The target endpoint of the unit. Throws `std::exception` without a computer system.
std::int32_t buildTargetEndpoint(San_Unit_Build& build);
/// The endpoint's place in the system.
std::int32_t hostTargetEndpoint(San_Unit_Build& build);

// --- Devices (SanDevices.cpp)

/// The unit as a device, with its place in the system and the path to it.
std::int32_t buildDevice(San_Unit_Build& build);

// --- Optimized access storage (SanOAS.cpp)

/// A remote port behind a port, with the chip that drives the port.
struct Port_Target {
  std::string port;             ///< WWPN of the port
  std::string target;           ///< WWPN of the remote port
  TVXHBA_Chip* chip = nullptr;  ///< null where no chip has the name that the port gives
};

/// Takes one entry of `San_Build::portTargets` apart and finds its chip.
Port_Target findPortTarget(ProviderAgent& agent, const std::string& entry);
/// Visits the remote ports that the walk found, in their order, and forgets them.
std::int32_t visitPortTargets(San_Build& build);

}  // namespace cimrt
