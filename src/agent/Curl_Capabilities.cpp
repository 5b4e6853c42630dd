// Which transfer schemes the firmware service can offer on this machine.
#include <dlfcn.h>

#include "access/TVX_CurlLibrary.h"
#include "agent/HostedServices.h"
#include "common/CLogger.h"
#include "common/TVX_Common.h"

namespace cimrt {

namespace {

/// ftp, http, https and tftp.
constexpr std::uint16_t NETWORK_SCHEMES[] = {4, 5, 6, 8};

}  // namespace

void UpdateCURLCapabilities(TVXHBA_SoftwareInstallationServiceCapabilities& capabilities) {
  TVX_LOG(TVX_DBG, "Inside UpdateCURLCapabilities");
  if (IsReadOnlyFS()) return;
  TVX_CurlLibrary curl;
  if (!curl.open(curlUploadPlaces(), RTLD_NOW | RTLD_GLOBAL)) {
    TVX_LOG(TVX_INFO, "libcurl is not present. only file type URIScheme will be supported");
    return;
  }
  for (const std::uint16_t scheme : NETWORK_SCHEMES)
    capabilities.SupportedURISchemes.append(scheme);
  if (!curl.close()) TVX_LOG(TVX_ERR, "ERROR: UNABLE TO CLOSE DYNAMIC LIB");
}

}  // namespace cimrt
