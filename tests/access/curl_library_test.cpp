// The real dynamic linker and libcurls out of files: the system's, talking to servers on the
// loopback interface, and stand-ins that lack a function each.
#include <dlfcn.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <chrono>
#include <thread>

#include "Curl_Numbers.h"
#include "access/TVX_CurlLibrary.h"
#include "access/TVX_MethodWrapper.h"
#include "support/Full_Disk.h"
#include "support/Log_Capture.h"
#include "support/Loopback_Servers.h"
#include "support/System_Curl.h"
#include "support/Working_Folder.h"

namespace cimrt {
namespace {

using testing::Contains;
using testing::ElementsAre;
using testing::IsEmpty;
using tvx::test::Ftp_Server;
using tvx::test::Full_Disk;
using tvx::test::Http_Server;
using tvx::test::Log_Capture;
using tvx::test::openDescriptors;
using tvx::test::Tftp_Server;
using tvx::test::Working_Folder;

class Transfer : public testing::Test {
 protected:
  static void SetUpTestSuite() { ASSERT_TRUE(tvx::test::keepSystemCurl()); }

  Transfer() {
    for (const char* name : {"http_proxy", "ftp_proxy", "all_proxy", "ALL_PROXY"}) ::unsetenv(name);
    for (std::size_t i = 0; i < 100'000; i++) large += static_cast<char>(i * 7 + i / 251);
  }

  /// Code of the fetch, 0 if it left the status alone.
  std::uint32_t fetch(const std::string& uri) {
    Property<std::uint32_t> status{0, 1};
    fetched = false;
    path = TVX_MethodWrapper::downloadFileUsingCurl(String(uri.c_str()), status, fetched).c_str();
    EXPECT_EQ(status.is_null(), status.value == 0);
    return status.value;
  }

  Working_Folder folder;
  Log_Capture capture;
  std::string large;
  std::string path;
  bool fetched = false;
};

// ---- The system's libcurl ----

TEST_F(Transfer, FetchesOverHttp) {
  Http_Server server;
  server.put("images/large.fw", large);
  EXPECT_EQ(fetch(server.url("images/large.fw")), 0u);
  EXPECT_EQ(path, "large.fw");
  EXPECT_TRUE(fetched);
  EXPECT_TRUE(folder.read("large.fw") == large);
  EXPECT_THAT(folder.files(), ElementsAre("large.fw"));
}

TEST_F(Transfer, FetchesOverTftp) {
  Tftp_Server server;
  for (const std::size_t size : {0u, 511u, 512u, 1500u}) {
    server.put("small.fw", large.substr(0, size));
    EXPECT_EQ(fetch(server.url("small.fw")), 0u);
    EXPECT_TRUE(folder.read("small.fw") == large.substr(0, size)) << size;
  }
  EXPECT_EQ(fetch(server.url("other.fw")), 68u);
}

TEST_F(Transfer, FetchesOverFtp) {
  Ftp_Server server;
  server.put("large.fw", large);
  EXPECT_EQ(fetch(server.url("large.fw")), 0u);
  EXPECT_TRUE(folder.read("large.fw") == large);
  EXPECT_EQ(fetch(server.url("other.fw")), 78u);
}

TEST_F(Transfer, KeepsNothingOpen) {
  Http_Server server;
  server.put("image.fw", "image");
  fetch(server.url("image.fw"));  // what libcurl sets up once stays
  const std::size_t before = openDescriptors();
  for (int i = 0; i < 3; i++) {
    EXPECT_EQ(fetch(server.url("image.fw")), 0u);
    EXPECT_EQ(fetch("http://127.0.0.1:1/image.fw"), 7u);
    EXPECT_EQ(TVX_MethodWrapper::uploadFileUsingCurl(String(server.url("up").c_str()), "image.fw"),
              0);
    EXPECT_EQ(TVX_MethodWrapper::uploadFileUsingCurl(String("http://127.0.0.1:1/up"), "image.fw"),
              -1);
  }
  // The server's own ends close when its thread comes to it; one may have been open before, too.
  for (int i = 0; i < 200 && openDescriptors() > before; i++)
    std::this_thread::sleep_for(std::chrono::milliseconds(10));
  EXPECT_LE(openDescriptors(), before);
}

TEST_F(Transfer, WhatTheServerAnswersIsTheFile) {
  Http_Server server;
  EXPECT_EQ(fetch(server.url("other.fw")), 0u);
  EXPECT_EQ(folder.read("other.fw"), "not found");
}

TEST_F(Transfer, AConnectionThatBreaksLeavesAPart) {
  Http_Server server;
  server.put("large.fw", large);
  server.cutAfter = 1000;
  EXPECT_EQ(fetch(server.url("large.fw")), 18u);
  EXPECT_TRUE(fetched);
  EXPECT_EQ(folder.read("large.fw"), large.substr(0, 1000));
  EXPECT_TRUE(capture.has(3, "download failed 18"));
}

TEST_F(Transfer, UrisThatCannotBeServedAnswerLibcurlsCodes) {
  EXPECT_EQ(fetch("file:///no/such/image.fw"), 37u);
  EXPECT_EQ(path, "image.fw");
  EXPECT_EQ(fetch("strange://127.0.0.1/image.fw"), 1u);
  for (const std::string uri : {"http://127.0.0.1:bad/image.fw", "http://[::1/image.fw",
                                "/no/such/image.fw", "http://127.0.0.1:1/with blank"}) {
    EXPECT_EQ(fetch(uri), 3u) << uri;
    EXPECT_EQ(path, uri);
    EXPECT_TRUE(fetched);
  }
}

TEST_F(Transfer, AFullDiskFailsTheTransfer) {
  Http_Server server;
  server.put("large.fw", large);
  server.put("small.fw", large.substr(0, 300));
  {
    const Full_Disk disk(4096);
    EXPECT_EQ(fetch(server.url("large.fw")), 23u);
  }
  EXPECT_EQ(folder.read("large.fw").size(), 4096u);
  {
    const Full_Disk disk(100);
    EXPECT_EQ(fetch(server.url("small.fw")), 23u);
  }
  EXPECT_TRUE(fetched);
  EXPECT_EQ(fetch(server.url("large.fw")), 0u);
}

TEST_F(Transfer, SendsOverHttp) {
  Http_Server server;
  folder.write("table.xml", large);
  folder.write("empty", "");
  EXPECT_EQ(TVX_MethodWrapper::uploadFileUsingCurl(String(server.url("t").c_str()), "table.xml"),
            0);
  EXPECT_TRUE(server.content("t") == large);
  EXPECT_THAT(server.requests(), Contains("Authorization: Basic Og=="));
  EXPECT_EQ(TVX_MethodWrapper::uploadFileUsingCurl(String(server.url("e").c_str()), "empty"), 0);
  EXPECT_THAT(server.requests(), Contains("PUT /e HTTP/1.1"));
  EXPECT_EQ(TVX_MethodWrapper::uploadFileUsingCurl(String("nothing"), "table.xml"), -1);
}

TEST(Curl_Header, HasTheNumbersThatAreUsedHere) {
  const auto published = tvx::test::publishedCurlNumbers();
  if (published.empty()) return;  // the header is not on this machine
  const std::vector<long> here = {
      CURLOPT_FILE,       CURLOPT_URL,           CURLOPT_USERPWD,          CURLOPT_READDATA,
      CURLOPT_INFILE,     CURLOPT_ERRORBUFFER,   CURLOPT_TIMEOUT,          CURLOPT_INFILESIZE,
      CURLOPT_UPLOAD,     CURLOPT_PUT,           CURLOPT_SSL_VERIFYPEER,   CURLOPT_SSL_VERIFYHOST,
      CURLOPT_HTTPAUTH,   CURLOPT_WRITEFUNCTION, CURLOPT_INFILESIZE_LARGE, CURL_GLOBAL_ALL,
      CURLE_URL_MALFORMAT};
  EXPECT_EQ(here, published);
}

// ---- Libraries out of files ----

/// The real linker, but for the libcurl that is found: a file of the test.
class Found_Curl {
 public:
  explicit Found_Curl(const std::string& file) {
    found() = file;
    static constexpr TVX_Dl_Operations OPERATIONS = {
        [](const char* name, int mode) -> void* {
          return ::dlopen(std::string(name) == "libcurl.so" ? found().c_str() : "/none/x", mode);
        },
        [](void* handle, const char* name) { return ::dlsym(handle, name); },
        [](void* handle) { return ::dlclose(handle); },
        []() -> const char* { return ::dlerror(); },
    };
    setDlOperations(&OPERATIONS);
  }
  ~Found_Curl() { setDlOperations(nullptr); }
  Found_Curl(const Found_Curl&) = delete;
  Found_Curl& operator=(const Found_Curl&) = delete;

 private:
  static std::string& found() {
    static std::string file;
    return file;
  }
};

std::string standIn(const std::string& without) {
  return std::string(TVX_STAND_INS "/") + without + "/libcurl.so";
}

TEST_F(Transfer, AStandInServes) {
  const Found_Curl linker(standIn("nothing"));
  EXPECT_EQ(fetch("http://host/image.fw"), 0u);
  EXPECT_EQ(folder.read("image.fw"), "stand-in");
  EXPECT_TRUE(capture.has(5, "Curl version = stand-in"));
}

TEST_F(Transfer, AStandInThatLacksAFunctionIsNoneThatTransfers) {
  const struct {
    const char* without;
    std::uint32_t status;
    bool fetched;
    const char* content;
    int upload;
  } rows[] = {
      {"curl_version", 0, true, "stand-in", 0},
      {"curl_global_init", 4, false, "", -1},
      {"curl_easy_init", 4, false, "", -1},
      {"curl_easy_setopt", 4, true, "", -1},
      {"curl_easy_perform", 4, true, "", -1},
      {"curl_easy_cleanup", 4, true, "stand-in", 0},
      {"curl_global_cleanup", 0, true, "stand-in", 0},
  };
  folder.write("table.xml", "<content/>");
  const std::size_t before = openDescriptors();
  for (const auto& row : rows) {
    const Found_Curl linker(standIn(row.without));
    EXPECT_EQ(fetch("http://host/image.fw"), row.status) << row.without;
    EXPECT_EQ(fetched, row.fetched) << row.without;
    EXPECT_EQ(folder.read("image.fw"), row.content) << row.without;
    EXPECT_EQ(TVX_MethodWrapper::uploadFileUsingCurl(String("http://host/t"), "table.xml"),
              row.upload)
        << row.without;
  }
  EXPECT_EQ(openDescriptors(), before);
}

TEST_F(Transfer, AFileThatIsNoLibraryIsNoLibcurl) {
  folder.write("text.so", "no library");
  const Found_Curl linker(folder.path("text.so"));
  EXPECT_EQ(fetch("http://host/image.fw"), 0u);
  EXPECT_EQ(path, "http://host/image.fw");
  EXPECT_FALSE(fetched);
  EXPECT_TRUE(capture.has(3, "ERROR: Could not load the curl library to download from internet"));
  EXPECT_THAT(folder.files(), ElementsAre("text.so"));
}

}  // namespace
}  // namespace cimrt
