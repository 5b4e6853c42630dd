// A file from a URI: the local one that it names, or one that libcurl fetches.
#include <dlfcn.h>
#include <sys/stat.h>

#include <array>
#include <cstdio>
#include <cstring>
#include <string>

#include "access/TVX_CurlLibrary.h"
#include "access/TVX_MethodWrapper.h"
#include "common/CLogger.h"
#include "common/TVX_File.h"
#include "common/TVX_Uri.h"
#include "runtime/Safe_Open.h"

namespace cimrt {

namespace {

using Status = Property<std::uint32_t>;

/// Status of a libcurl that lacks a function.
constexpr std::uint32_t FUNCTION_MISSING = 4;
/// libcurl asks for at least 256 bytes.
constexpr std::size_t ERROR_BUFFER_SIZE = 512;

/// The path inside a file URI, wherever in the text that begins; any other text as it is.
String pathOf(const String& uri) {
  struct Prefix {
    const char* text;
    std::size_t skipped;  ///< characters before the path's own "/"
  };
  static constexpr Prefix PREFIXES[] = {{"file:///", 7}, {"file://localhost/", 16}};
  for (const Prefix& prefix : PREFIXES) {
    const std::size_t start = uri.find(prefix.text);
    if (start != String::npos) return uri.substr(start + prefix.skipped);
  }
  return uri;
}

bool exists(const char* path) {
  struct stat info;
  return ::stat(path, &info) == 0;
}

/// The name behind the last "/"; false if there is no "/".
bool nameOf(const String& uri, String& name) {
  const char* const slash = std::strrchr(uri.c_str(), '/');
  if (slash == nullptr) return false;
  name = String(slash + 1);
  return true;
}

std::size_t writeToFile(char* data, std::size_t size, std::size_t count, void* stream) {
  return size * std::fwrite(data, size, count, static_cast<std::FILE*>(stream));
}

/// One fetch with an open library into an open file.
class Fetch {
 public:
  Fetch(TVX_CurlLibrary& curl, const String& uri, std::FILE* file, Status& status)
      : m_Curl(curl), m_Uri(uri.c_str()), m_pFile(file), m_Status(status) {}

  /// False if no handle could be had; then nothing was begun.
  bool begin();
  /// Sets the options and, if that went well, transfers. True for a URI that libcurl can't read.
  bool transfer();
  void end();

 private:
  bool setOptions(Curl_Easy_Setopt setOption);
  bool check(int code, const char* failure);

  TVX_CurlLibrary& m_Curl;
  std::string m_Uri;
  std::FILE* m_pFile;
  Status& m_Status;
  void* m_pEasy = nullptr;
  std::array<char, ERROR_BUFFER_SIZE> m_ErrorText{};
};

bool Fetch::begin() {
  int code = 0;
  const bool initialised = m_Curl.initialise(code);
  if (!initialised) m_Status.set(FUNCTION_MISSING);
  if (code != 0) m_Status.set(static_cast<std::uint32_t>(code));
  const auto easyInit = m_Curl.findTellingErrors<Curl_Easy_Init>("curl_easy_init");
  if (!initialised || easyInit == nullptr) {
    TVX_LOG(TVX_ERR, "unable to locate function curl_easy_init in curl so");
    m_Status.set(FUNCTION_MISSING);
    return false;
  }
  m_pEasy = easyInit();
  if (m_pEasy == nullptr) {
    TVX_LOG(TVX_ERR, "ERROR: Could not initialise the curl");
    return false;
  }
  TVX_LOG(TVX_DBG, "initialized the curl library to download from internet");
  return true;
}

bool Fetch::check(int code, const char* failure) {
  if (code == 0) return true;
  // The text has one "%d", which the number replaces.
  const char* const number = std::strstr(failure, "%d");
  TVX_LOG(TVX_ERR, "%.*s%d", static_cast<int>(number - failure), failure, code);
  m_Status.set(static_cast<std::uint32_t>(code));
  return false;
}

bool Fetch::setOptions(Curl_Easy_Setopt setOption) {
  const Curl_Write_Function writer = writeToFile;
  constexpr long OFF = 0;
  return check(setOption(m_pEasy, CURLOPT_URL, m_Uri.c_str()),
               "Error Sending the URI to the Curl library %d") &&
         check(setOption(m_pEasy, CURLOPT_WRITEFUNCTION, writer),
               "Error Sending the CURLOPT_FILE to the Curl library %d") &&
         check(setOption(m_pEasy, CURLOPT_FILE, m_pFile),
               "Error Sending the CURLOPT_FILE to the Curl library %d") &&
         check(setOption(m_pEasy, CURLOPT_ERRORBUFFER, m_ErrorText.data()),
               "Error Sending the CURLOPT_ERRORBUFFER to the Curl library %d") &&
         check(setOption(m_pEasy, CURLOPT_SSL_VERIFYPEER, OFF),
               "Error setting CURLOPT_SSL_VERIFYPEER in the Curl library %d") &&
         check(setOption(m_pEasy, CURLOPT_SSL_VERIFYHOST, OFF),
               "Error setting CURLOPT_SSL_VERIFYHOST in the Curl library %d");
}

bool Fetch::transfer() {
  const auto setOption = m_Curl.find<Curl_Easy_Setopt>("curl_easy_setopt");
  if (setOption == nullptr) {
    TVX_LOG(TVX_ERR, "unable to locate function curl_easy_setopt in curl so");
    m_Status.set(FUNCTION_MISSING);
  }
  TVX_LOG(TVX_DBG, "Sending the URI %s to the Curl library", tvxWithoutPassword(m_Uri).c_str());
  if (setOption == nullptr || !setOptions(setOption)) return false;
  const auto perform = m_Curl.find<Curl_Easy_Perform>("curl_easy_perform");
  if (perform == nullptr) {
    TVX_LOG(TVX_ERR, "unable to locate function curl_easy_perform in curl so");
    m_Status.set(FUNCTION_MISSING);
    return false;
  }
  const int code = perform(m_pEasy);
  check(code, "download failed %d");
  return code == CURLE_URL_MALFORMAT;
}

void Fetch::end() {
  const auto easyCleanup = m_Curl.find<Curl_Easy_Cleanup>("curl_easy_cleanup");
  if (easyCleanup == nullptr) {
    TVX_LOG(TVX_ERR, "unable to locate function curl_easy_cleanup in curl so");
    m_Status.set(FUNCTION_MISSING);
    return;
  }
  TVX_LOG(TVX_DBG, "Found the function curl_easy_cleanup in curl so");
  easyCleanup(m_pEasy);
  const auto globalCleanup = m_Curl.find<Curl_Global_Cleanup>("curl_global_cleanup");
  if (globalCleanup == nullptr) {
    TVX_LOG(TVX_ERR, "could not locate curl_global_cleanup in libcurl");
    return;
  }
  globalCleanup();
}

/// True for a file, or a link to one, that is there under the name.
bool isFileOrLink(const char* path) {
  struct stat info;
  return ::lstat(path, &info) == 0 && (S_ISREG(info.st_mode) || S_ISLNK(info.st_mode));
}

/// The file that a fetch fills; null with the reason logged. It is not buffered, so that what does
/// not fit on the disk fails the transfer and not the silent end of it.
TVX_File openTarget(const String& path) {
  TVX_File file(open_for_writing(path.c_str(), "w", LOG_PERMISSIONS));
  if (file) {
    std::setvbuf(file.get(), nullptr, _IONBF, 0);
  } else {
    TVX_LOG(TVX_ERR, "ERROR: Could not open the file for writing");
  }
  return file;
}

bool openCurl(TVX_CurlLibrary& curl) {
  TVX_LOG(TVX_INFO, "File not found on local file system. Trying libcURL...");
  const bool opened = curl.open(curlDownloadPlaces(), RTLD_LAZY | RTLD_GLOBAL);
  TVX_CurlLibrary::tellOpening(CURL_BY_NAME);
  if (opened) return true;
  TVX_LOG(TVX_ERR, "ERROR: Could not load the curl library to download from internet");
  return false;
}

void closeCurl(TVX_CurlLibrary& curl) {
  if (curl.close()) {
    TVX_LOG(TVX_DBG, "Successfully closed curl so");
  } else {
    TVX_LOG(TVX_ERR, "UNABLE TO CLOSE DYNAMIC LIB");
  }
}

/// Fetches into the file `path`, which becomes the URI again if libcurl can't read that, and if
/// somebody else's file has the name: the caller must not take that one for what was fetched.
void fetchFile(TVX_CurlLibrary& curl, const String& uri, String& path, Status& status,
               bool& fetched) {
  const TVX_File file = openTarget(path);
  if (!file) {
    if (isFileOrLink(path.c_str())) path = uri;
    return;
  }
  TVX_LOG(TVX_DBG, "OPENED the curl library to download from internet");
  curl.tellVersion();
  Fetch fetch(curl, uri, file.get(), status);
  if (!fetch.begin()) return;
  if (fetch.transfer()) path = uri;
  fetched = true;
  fetch.end();
  closeCurl(curl);
}

}  // namespace

String TVX_MethodWrapper::downloadFileUsingCurl(const String& URI, Property<std::uint32_t>& status,
                                                bool& fetched) {
  TVX_LOG(TVX_DBG, "TVX_MethodWrapper::downloadFileUsingCurl: %s",
          tvxWithoutPassword(URI.c_str()).c_str());
  String path = pathOf(URI);
  TVX_LOG(TVX_DBG, "TVX_MethodWrapper::Firmware file path: %s",
          tvxWithoutPassword(path.c_str()).c_str());
  if (exists(path.c_str())) {
    TVX_LOG(TVX_ERR, "File found in local file system.");
    return path;
  }
  TVX_CurlLibrary curl;
  if (!openCurl(curl)) return path;
  if (!nameOf(URI, path)) {
    TVX_LOG(TVX_ERR, "ERROR: Could not parse the URI to get the firmware file name");
    return path;
  }
  fetchFile(curl, URI, path, status, fetched);
  return path;
}

}  // namespace cimrt
