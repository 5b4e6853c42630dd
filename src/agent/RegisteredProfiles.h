// The management profiles that this provider conforms to, and their registration in the maps.
#pragma once

#include <cstdint>
#include <span>
#include <string>

#include "agent/MapBuild.h"

namespace cimrt {

/// Namespace of the profile instances.
inline constexpr const char* INTEROP_NAME_SPACE = "root/pg_interop";

/// `RegisteredOrganization` of the profiles' two owners.
inline constexpr std::uint16_t ORGANIZATION_DMTF = 2;
inline constexpr std::uint16_t ORGANIZATION_SNIA = 11;

/// One profile.
struct Profile_Row {
  const char* name;
  std::uint16_t organization;
  const char* version;
};

/// The profiles that every host registers, in the order of their registration.
std::span<const Profile_Row> baseProfiles();
/// All profiles, in the order in which their class is enumerated.
std::span<const Profile_Row> enumeratedProfiles();
/// The profiles that "Profile Registration" and the Base Server profile refer to, in order.
std::span<const Profile_Row> referencedProfiles();

/// `InstanceID` of a profile: "TVX:" and its name.
std::string profileInstanceID(const char* name);

/// A new instance of a profile, in the interop namespace. The caller owns it. Any thread.
Ref<TVXHBA_RegisteredProfile> makeRegisteredProfile(const Profile_Row& row);

/// The profile of that name in the agent's map, made if it is not there yet; what the first caller
/// gave stands. Null with the failure logged if it could not be inserted.
/// This and all below: on the refresh thread, with the agent's map and data locks held.
TVXHBA_RegisteredProfile* createRegisteredProfile(ProviderAgent& agent, const char* name,
                                                  std::uint16_t organization, const char* version);

/// The profile of that name in the agent's map, or null.
TVXHBA_RegisteredProfile* findRegisteredProfile(ProviderAgent& agent, const char* name);

/// Ties the computer system to a profile, unless the system is the platform's.
void createComputerSystemConformsToProfile(ProviderAgent& agent,
                                           const TVXHBA_RegisteredProfile* profile);

/// Build step: registers the base profiles, and ties the computer system to each.
std::int32_t registerBaseProfiles(Host_Build& host);

}  // namespace cimrt
