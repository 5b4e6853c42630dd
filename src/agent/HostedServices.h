// The services that the provider hosts, as instances with their associations. What their methods do
// lies elsewhere.
#pragma once

#include "agent/MapBuild.h"

namespace cimrt {

/// Build step: the five services, the access point of the management page, and the drivers, in this
/// order. The first failure is logged and ends the build.
std::int32_t startServices(Host_Build& host);

/// Build step: ties a port to the services that act on it.
std::int32_t buildServiceAssociations(Port_Build& port);

// The single steps of `startServices`; each fails when an instance is refused by its map.
std::int32_t StartSoftwareInstallationService(Host_Build& host);
std::int32_t StartFCHBAWWNService(Host_Build& host);
std::int32_t StartFCTagService(Host_Build& host);
std::int32_t StartBootBIOSService(Host_Build& host);
std::int32_t StartFCHBADriverParamService(Host_Build& host);
/// Makes nothing, and succeeds, when no address is configured.
std::int32_t CreateHBAAccessPointProfiles(Host_Build& host);

/// Appends the transfer schemes beyond plain files if the transfer library can be opened and the
/// root file system can be written.
void UpdateCURLCapabilities(TVXHBA_SoftwareInstallationServiceCapabilities& capabilities);

}  // namespace cimrt
