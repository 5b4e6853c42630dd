#include "access/TVX_CurlLibrary.h"

#include <utility>

#include "common/CLogger.h"

namespace cimrt {

namespace {

constexpr const char* BY_NAME_TEXT = "Checking with libcurl.so system location for libcurl";

constexpr Curl_Place DOWNLOAD_PLACES[] = {
    {"/lib/libcurl.so.4", "Searching for /lib/libcurl.so.4 Curl on the machine", false},
    {"/usr/lib/libcurl.so.4", "Searching for /usr/lib/libcurl.so.4 Curl on the machine", false},
    {"/usr/lib64/libcurl.so.4", "Searching for /usr/lib64/libcurl.so.4 Curl on the machine", false},
    {CURL_BY_NAME, BY_NAME_TEXT, false},
};

constexpr Curl_Place UPLOAD_PLACES[] = {
    {"/lib/libcurl.so.4", "Searching for /lib Curl on the machine", true},
    {"/usr/lib/libcurl.so.4", "Searching for /usr/lib/ Curl on the machine", true},
    {CURL_BY_NAME, BY_NAME_TEXT, true},
    {"curl.dll", "Checking with curl.dll windows system location for libcurl", false},
};

}  // namespace

std::span<const Curl_Place> curlDownloadPlaces() {
  return DOWNLOAD_PLACES;
}

std::span<const Curl_Place> curlUploadPlaces() {
  return UPLOAD_PLACES;
}

bool TVX_CurlLibrary::open(std::span<const Curl_Place> places, int mode) {
  for (const Curl_Place& place : places) {
    TVX_LOG(TVX_DBG, "%s", place.announcement);
    m_pHandle = dlOperations().open(place.file, mode);
    if (place.tellsError) tellOpening(place.file);
    if (isOpen()) return true;
  }
  return false;
}

void TVX_CurlLibrary::tellOpening(const char* file) {
  const char* const error = dlOperations().error();
  TVX_LOG(TVX_DBG, "dlopen returned for %s = %s\n", file, error ? error : "");
}

void* TVX_CurlLibrary::symbol(const char* name) const {
  return isOpen() ? dlOperations().symbol(m_pHandle, name) : nullptr;
}

void TVX_CurlLibrary::tellLinkingError() {
  if (const char* const error = dlOperations().error())
    TVX_LOG(TVX_DBG, "A dynamic linking error occurred:(%s)", error);
}

void TVX_CurlLibrary::tellVersion() const {
  const auto version = find<Curl_Version>("curl_version");
  if (version == nullptr) return;
  TVX_LOG(TVX_DBG, "Found curl_version function");
  const char* const text = version();
  TVX_LOG(TVX_DBG, "Curl version = %s", text ? text : "");
}

bool TVX_CurlLibrary::initialise(int& code) const {
  const auto globalInit = find<Curl_Global_Init>("curl_global_init");
  if (globalInit == nullptr) {
    TVX_LOG(TVX_ERR, "unable to locate function curl_global_init in curl so");
    return false;
  }
  TVX_LOG(TVX_DBG, "execute function curl_global_init in curl so");
  code = globalInit(CURL_GLOBAL_ALL);
  if (code != 0) TVX_LOG(TVX_ERR, "unable to initalize curl");
  return true;
}

bool TVX_CurlLibrary::close() {
  void* const handle = std::exchange(m_pHandle, nullptr);
  return handle == nullptr || dlOperations().close(handle) == 0;
}

}  // namespace cimrt
