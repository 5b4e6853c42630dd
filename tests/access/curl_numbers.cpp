#include "Curl_Numbers.h"

#if __has_include(<curl/curl.h>)
#include <curl/curl.h>
#define TVX_HAS_CURL_HEADER
#pragma GCC diagnostic ignored "-Wdeprecated-declarations"
#endif

namespace tvx::test {

std::vector<long> publishedCurlNumbers() {
#ifdef TVX_HAS_CURL_HEADER
  return {
      CURLOPT_FILE,       CURLOPT_URL,           CURLOPT_USERPWD,          CURLOPT_READDATA,
      CURLOPT_INFILE,     CURLOPT_ERRORBUFFER,   CURLOPT_TIMEOUT,          CURLOPT_INFILESIZE,
      CURLOPT_UPLOAD,     CURLOPT_PUT,           CURLOPT_SSL_VERIFYPEER,   CURLOPT_SSL_VERIFYHOST,
      CURLOPT_HTTPAUTH,   CURLOPT_WRITEFUNCTION, CURLOPT_INFILESIZE_LARGE, CURL_GLOBAL_ALL,
      CURLE_URL_MALFORMAT};
#else
  return {};
#endif
}

}  // namespace tvx::test
