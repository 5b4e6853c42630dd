// Which transfer schemes the firmware service can offer on this machine.
#include <dlfcn.h>

#include "access/TVX_Runtime_Loader.h"
#include "agent/HostedServices.h"
#include "common/CLogger.h"
#include "common/TVX_Common.h"

namespace cimrt {

namespace {

struct Curl_Candidate {
  const char* file;
  const char* announcement;
};

constexpr Curl_Candidate CANDIDATES[] = {
    {"/lib/libcurl.so.4", "Searching for /lib Curl on the machine"},
    {"/usr/lib/libcurl.so.4", "Searching for /usr/lib/ Curl on the machine"},
    {"libcurl.so", "Checking with libcurl.so system location for libcurl"},
    {"curl.dll", "Checking with curl.dll windows system location for libcurl"},
};

/// ftp, http, https and tftp.
constexpr std::uint16_t NETWORK_SCHEMES[] = {4, 5, 6, 8};

void* openCurl(const TVX_Dl_Operations& linker) {
  for (const Curl_Candidate& candidate : CANDIDATES) {
    TVX_LOG(TVX_DBG, "%s", candidate.announcement);
    void* const handle = linker.open(candidate.file, RTLD_NOW | RTLD_GLOBAL);
    const char* const error = linker.error();
    TVX_LOG(TVX_DBG, "dlopen returned for %s = %s\n", candidate.file, error ? error : "");
    if (handle) return handle;
  }
  return nullptr;
}

}  // namespace

void UpdateCURLCapabilities(TVXHBA_SoftwareInstallationServiceCapabilities& capabilities) {
  TVX_LOG(TVX_DBG, "Inside UpdateCURLCapabilities");
  if (IsReadOnlyFS()) return;
  const TVX_Dl_Operations& linker = dlOperations();
  void* const handle = openCurl(linker);
  if (!handle) {
    TVX_LOG(TVX_INFO, "libcurl is not present. only file type URIScheme will be supported");
    return;
  }
  for (const std::uint16_t scheme : NETWORK_SCHEMES)
    capabilities.SupportedURISchemes.append(scheme);
  if (linker.close(handle) != 0) TVX_LOG(TVX_ERR, "ERROR: UNABLE TO CLOSE DYNAMIC LIB");
}

}  // namespace cimrt
