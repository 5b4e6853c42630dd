// A local file to a URI.
#include <dlfcn.h>
#include <sys/stat.h>

#include <cstdio>
#include <cstring>

#include "access/TVX_CurlLibrary.h"
#include "access/TVX_MethodWrapper.h"
#include "common/CLogger.h"
#include "common/TVX_File.h"
#include "common/TVX_Uri.h"

namespace cimrt {

namespace {

constexpr int UPLOADED = 0;
constexpr int CANNOT_OPEN = 1;
constexpr int UPLOAD_FAILED = -1;
constexpr long TIMEOUT_SECONDS = 100;
constexpr long BASIC_AUTHENTICATION = 1;

/// Opens and initialises libcurl. The handle, or null.
void* setUp(TVX_CurlLibrary& curl) {
  if (!curl.open(curlUploadPlaces(), RTLD_NOW | RTLD_GLOBAL)) {
    TVX_LOG(TVX_ERR, "ERROR: Could not load the curl library ");
    return nullptr;
  }
  curl.tellVersion();
  int code = 0;
  if (!curl.initialise(code) || code != 0) return nullptr;
  const auto easyInit = curl.findTellingErrors<Curl_Easy_Init>("curl_easy_init");
  if (easyInit == nullptr) {
    TVX_LOG(TVX_ERR, "unable to locate function curl_easy_init in curl so");
    return nullptr;
  }
  void* const easy = easyInit();
  if (easy == nullptr) TVX_LOG(TVX_ERR, "ERROR: Could not initialise the curl");
  return easy;
}

long sizeOf(std::FILE* file) {
  std::fseek(file, 0, SEEK_END);
  const long size = std::ftell(file);
  std::fseek(file, 0, SEEK_SET);
  return size;
}

bool check(int code, const char* failure) {
  if (code == 0) return true;
  // The text ends with the number.
  const char* const number = std::strstr(failure, "%d");
  TVX_LOG(TVX_ERR, "%.*s%d", static_cast<int>(number - failure), failure, code);
  return false;
}

bool setUploading(Curl_Easy_Setopt setOption, void* easy) {
  constexpr long ON = 1;
  if (!check(setOption(easy, CURLOPT_UPLOAD, ON), "Error Setting CURLOPT_UPLOAD, errorcode = %d"))
    return false;
  TVX_LOG(TVX_DBG, "Successfully Set CURLOPT_UPLOAD = %d", 0);
  return check(setOption(easy, CURLOPT_PUT, ON), "Error setting the CURLOPT_PUT,error code %d");
}

bool setSource(Curl_Easy_Setopt setOption, void* easy, std::FILE* file, long size) {
  return check(setOption(easy, CURLOPT_READDATA, file),
               "Error Setting CURLOPT_READDATA, errorcode = %d") &&
         check(setOption(easy, CURLOPT_INFILE, file),
               "Error Setting CURLOPT_INFILE, errorcode = %d") &&
         check(setOption(easy, CURLOPT_TIMEOUT, TIMEOUT_SECONDS),
               "Error Setting CURLOPT_TIMEOUT, errorcode = %d") &&
         check(setOption(easy, CURLOPT_INFILESIZE, size),
               "Error Setting CURLOPT_INFILESIZE, errorcode = %d") &&
         check(setOption(easy, CURLOPT_INFILESIZE_LARGE, static_cast<std::int64_t>(size)),
               "Error Setting CURLOPT_INFILESIZE_LARGE, errorcode = %d");
}

bool setSecurity(Curl_Easy_Setopt setOption, void* easy) {
  constexpr long OFF = 0;
  // Nothing configures credentials so far.
  char user[64] = {};
  char password[64] = {};
  char credentials[128] = {};
  std::snprintf(credentials, sizeof credentials, "%s:%s", user, password);
  return check(setOption(easy, CURLOPT_SSL_VERIFYPEER, OFF),
               "Error setting CURLOPT_SSL_VERIFYPEER in the Curl library, errorcode %d") &&
         check(setOption(easy, CURLOPT_SSL_VERIFYHOST, OFF),
               "Error setting CURLOPT_SSL_VERIFYHOST in the Curl library %d") &&
         check(setOption(easy, CURLOPT_USERPWD, credentials),
               "Error setting CURLOPT_USERPWD in the Curl library %d") &&
         check(setOption(easy, CURLOPT_HTTPAUTH, BASIC_AUTHENTICATION),
               "Error setting CURLOPT_USERPWD in the Curl library %d");
}

int transfer(const TVX_CurlLibrary& curl, void* easy, const String& uri, std::FILE* file) {
  const auto setOption = curl.findTellingErrors<Curl_Easy_Setopt>("curl_easy_setopt");
  if (setOption == nullptr) {
    TVX_LOG(TVX_ERR, "unable to locate function curl_easy_setopt in curl so");
    return UPLOAD_FAILED;
  }
  const long size = sizeOf(file);
  TVX_LOG(TVX_DBG, "iFileSize size:: %ld", size);
  TVX_LOG(TVX_DBG, "URI.value.c_str(): %s", tvxWithoutPassword(uri.c_str()).c_str());
  if (!setUploading(setOption, easy) ||
      !check(setOption(easy, CURLOPT_URL, uri.c_str()),
             "Error setting the CURLOPT_URL,error code %d") ||
      !setSource(setOption, easy, file, size) || !setSecurity(setOption, easy))
    return UPLOAD_FAILED;
  const auto perform = curl.find<Curl_Easy_Perform>("curl_easy_perform");
  if (perform == nullptr) {
    TVX_LOG(TVX_ERR, "dlsym, couldnot locate the symbol curl_easy_perform");
    return UPLOAD_FAILED;
  }
  return check(perform(easy), "curl upload file failed, errorcode %d") ? UPLOADED : UPLOAD_FAILED;
}

void tearDown(TVX_CurlLibrary& curl, void* easy) {
  const auto easyCleanup = curl.findTellingErrors<Curl_Easy_Cleanup>("curl_easy_cleanup");
  if (easyCleanup != nullptr) {
    easyCleanup(easy);
  } else {
    TVX_LOG(TVX_ERR, "unable to locate function curl_easy_cleanup in curl so");
  }
  const auto globalCleanup = curl.find<Curl_Global_Cleanup>("curl_global_cleanup");
  if (globalCleanup != nullptr) {
    globalCleanup();
  } else {
    TVX_LOG(TVX_ERR, "could not locate curl_global_cleanup in libcurl");
  }
  if (!curl.close()) TVX_LOG(TVX_ERR, "UNABLE TO CLOSE DYNAMIC LIB");
}

}  // namespace

int TVX_MethodWrapper::uploadFileUsingCurl(const String& URI, const char* localPath) {
  TVX_LOG(TVX_DBG, "Inside TVX_MethodWrapper::uploadFileUsingCurl");
  const char* const path = localPath != nullptr ? localPath : "";
  struct stat info;
  if (::stat(path, &info) != 0) {
    TVX_LOG(TVX_DBG, "couldnot locate the file %s, to be uploaded", path);
    return UPLOAD_FAILED;
  }
  TVX_CurlLibrary curl;
  void* const easy = setUp(curl);
  if (easy == nullptr) {
    TVX_LOG(TVX_DBG, "couldnot initialize curl library");
    return UPLOAD_FAILED;
  }
  int result = CANNOT_OPEN;
  if (const TVX_File file = tvxOpenFile(path)) {
    result = transfer(curl, easy, URI, file.get());
  }
  tearDown(curl, easy);
  return result;
}

}  // namespace cimrt
