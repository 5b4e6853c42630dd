// libcurl as the file transfers use it: opened by name when it is needed, never linked.
#pragma once

#include <cstdint>
#include <span>

#include "access/TVX_Runtime_Loader.h"

namespace cimrt {

/// Options of `curl_easy_setopt`, by the numbers of libcurl's public header.
enum Curl_Option : int {
  CURLOPT_FILE = 10001,
  CURLOPT_URL = 10002,
  CURLOPT_USERPWD = 10005,
  CURLOPT_READDATA = 10009,
  CURLOPT_INFILE = 10009,
  CURLOPT_ERRORBUFFER = 10010,
  CURLOPT_TIMEOUT = 13,
  CURLOPT_INFILESIZE = 14,
  CURLOPT_UPLOAD = 46,
  CURLOPT_PUT = 54,
  CURLOPT_SSL_VERIFYPEER = 64,
  CURLOPT_SSL_VERIFYHOST = 81,
  CURLOPT_HTTPAUTH = 107,
  CURLOPT_WRITEFUNCTION = 20011,
  CURLOPT_INFILESIZE_LARGE = 30115,
};

// The functions that are looked up, by their C types.
using Curl_Version = const char* (*)();
using Curl_Global_Init = int (*)(long flags);
using Curl_Global_Cleanup = void (*)();
using Curl_Easy_Init = void* (*)();
using Curl_Easy_Setopt = int (*)(void* handle, int option, ...);
using Curl_Easy_Perform = int (*)(void* handle);
using Curl_Easy_Cleanup = void (*)(void* handle);
using Curl_Write_Function = std::size_t (*)(char* data, std::size_t size, std::size_t count,
                                            void* stream);

/// What `curl_global_init` is called with: everything.
inline constexpr long CURL_GLOBAL_ALL = 3;
/// Code of a URL that libcurl can't read.
inline constexpr int CURLE_URL_MALFORMAT = 3;

/// The library where the linker finds it by itself.
inline constexpr const char* CURL_BY_NAME = "libcurl.so";

/// One place of a search, with what is logged before it is tried.
struct Curl_Place {
  const char* file;
  const char* announcement;
  bool tellsError;  ///< log the linker's error, or that there is none, after the try
};

/// Where a download looks; the other list is that of uploads and of the capabilities. They differ
/// on purpose.
std::span<const Curl_Place> curlDownloadPlaces();
std::span<const Curl_Place> curlUploadPlaces();

/// An open libcurl. Closes itself at the end, silently, unless `close` did it before. For one
/// thread.
class TVX_CurlLibrary {
 public:
  TVX_CurlLibrary() = default;
  ~TVX_CurlLibrary() { close(); }
  TVX_CurlLibrary(const TVX_CurlLibrary&) = delete;
  TVX_CurlLibrary& operator=(const TVX_CurlLibrary&) = delete;

  /// Tries the places in order until one opens. Not for an open library.
  /// @param mode that of `dlopen`
  /// @return true if one opened
  bool open(std::span<const Curl_Place> places, int mode);
  bool isOpen() const { return m_pHandle != nullptr; }

  /// The function of that name, or null.
  template <class Function>
  Function find(const char* name) const {
    return reinterpret_cast<Function>(symbol(name));
  }
  /// The same, with "A dynamic linking error occurred:(%s)" logged if the linker has an error.
  template <class Function>
  Function findTellingErrors(const char* name) const {
    const auto function = find<Function>(name);
    tellLinkingError();
    return function;
  }

  /// Logs how the try of the place ended, by the linker's last error.
  static void tellOpening(const char* file);

  /// Logs the version, if the library tells one.
  void tellVersion() const;
  /// Runs `curl_global_init`, with its two failures logged.
  /// @param code what the function answered; left as it was if it is missing
  /// @return false if the function is missing
  bool initialise(int& code) const;

  /// Closes the library. True if that worked or nothing was open.
  bool close();

 private:
  void* symbol(const char* name) const;
  static void tellLinkingError();

  void* m_pHandle = nullptr;
};

}  // namespace cimrt
