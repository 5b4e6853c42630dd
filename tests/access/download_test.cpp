// Files from URIs, step by step over a scripted libcurl.
#include <dlfcn.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "Scripted_Curl.h"
#include "access/TVX_MethodWrapper.h"
#include "support/Log_Capture.h"
#include "support/Working_Folder.h"

namespace cimrt {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;
using testing::StartsWith;
using tvx::test::Log_Capture;
using tvx::test::Logged;
using tvx::test::openDescriptors;
using tvx::test::Scripted_Curl;
using tvx::test::Working_Folder;

constexpr const char* URI = "http://host/folder/image.fw";

class Download : public testing::Test {
 protected:
  Download() {
    status.value = 0;
    status.null = 1;
  }

  /// The answered path.
  std::string download(const std::string& uri = URI) {
    return TVX_MethodWrapper::downloadFileUsingCurl(String(uri.c_str()), status, fetched).c_str();
  }
  void expectStatus(std::uint32_t code) const {
    EXPECT_FALSE(status.is_null());
    EXPECT_EQ(status.value, code);
  }
  bool called(const std::string& function) const {
    return std::count(curl.calls.begin(), curl.calls.end(), function) != 0;
  }

  Working_Folder folder;
  Scripted_Curl curl;
  Log_Capture capture;
  Property<std::uint32_t> status;
  bool fetched = false;
};

// ---- Local files ----

TEST_F(Download, ALocalFileIsAnsweredWithoutLibcurl) {
  folder.write("image.fw", "local");
  EXPECT_EQ(download(folder.path("image.fw")), folder.path("image.fw"));
  EXPECT_TRUE(status.is_null());
  EXPECT_FALSE(fetched);
  EXPECT_THAT(curl.opened, IsEmpty());
  EXPECT_THAT(
      capture.lines(),
      ElementsAre(Logged{5, "TVX_MethodWrapper::downloadFileUsingCurl: " + folder.path("image.fw")},
                  Logged{5, "TVX_MethodWrapper::Firmware file path: " + folder.path("image.fw")},
                  Logged{3, "File found in local file system."}));
}

TEST_F(Download, FileUrisAreCutToTheirPathWhereverTheyBegin) {
  folder.write("a b%20c..fw", "local");
  const std::string path = folder.path("a b%20c..fw");
  for (const std::string prefix : {"file://", "file://localhost", "x file://", "http://h/?file://",
                                   "file://localhost/file://"})
    EXPECT_EQ(download(prefix + path), path) << prefix;
  EXPECT_THAT(curl.opened, IsEmpty());
}

TEST_F(Download, AFolderCountsAsAFileThatIsThere) {
  EXPECT_EQ(download("file:///"), "/");
  EXPECT_THAT(curl.opened, IsEmpty());
}

// ---- The search ----

TEST_F(Download, TheLibraryIsSearchedInItsOwnOrder) {
  curl.present = "none";
  EXPECT_EQ(download(), URI);
  const std::string mode = " " + std::to_string(RTLD_LAZY | RTLD_GLOBAL);
  EXPECT_THAT(curl.opened, ElementsAre("/lib/libcurl.so.4" + mode, "/usr/lib/libcurl.so.4" + mode,
                                       "/usr/lib64/libcurl.so.4" + mode, "libcurl.so" + mode));
  EXPECT_THAT(
      capture.lines(),
      ElementsAre(Logged{5, std::string("TVX_MethodWrapper::downloadFileUsingCurl: ") + URI},
                  Logged{5, std::string("TVX_MethodWrapper::Firmware file path: ") + URI},
                  Logged{4, "File not found on local file system. Trying libcURL..."},
                  Logged{5, "Searching for /lib/libcurl.so.4 Curl on the machine"},
                  Logged{5, "Searching for /usr/lib/libcurl.so.4 Curl on the machine"},
                  Logged{5, "Searching for /usr/lib64/libcurl.so.4 Curl on the machine"},
                  Logged{5, "Checking with libcurl.so system location for libcurl"},
                  Logged{5, "dlopen returned for libcurl.so = no such library\n"},
                  Logged{3, "ERROR: Could not load the curl library to download from internet"}));
  EXPECT_TRUE(status.is_null());
  EXPECT_FALSE(fetched);
  EXPECT_THAT(folder.files(), IsEmpty());
}

TEST_F(Download, TheFirstLibraryThatOpensIsTaken) {
  std::size_t tried = 0;
  for (const char* place :
       {"/lib/libcurl.so.4", "/usr/lib/libcurl.so.4", "/usr/lib64/libcurl.so.4", "libcurl.so"}) {
    curl.present = place;
    curl.opened.clear();
    EXPECT_EQ(download(), "image.fw");
    EXPECT_EQ(curl.opened.size(), ++tried);
    EXPECT_THAT(curl.opened.back(), StartsWith(place));
  }
  EXPECT_TRUE(capture.has(5, "dlopen returned for libcurl.so = \n"));
}

// ---- The transfer ----

TEST_F(Download, AFileIsFetchedIntoTheWorkingDirectory) {
  const std::size_t before = openDescriptors();
  EXPECT_EQ(download(), "image.fw");
  EXPECT_EQ(folder.read("image.fw"), "fetched");
  EXPECT_TRUE(status.is_null());
  EXPECT_TRUE(fetched);
  EXPECT_THAT(curl.options, ElementsAre("10002=http://host/folder/image.fw", "20011=pointer",
                                        "10001=pointer", "10010=cleared", "64=0", "81=0"));
  EXPECT_THAT(curl.calls,
              ElementsAre("curl_version", "curl_global_init 3", "curl_easy_init",
                          "curl_easy_perform", "curl_easy_cleanup", "curl_global_cleanup"));
  EXPECT_EQ(curl.openLibraries, 0);
  EXPECT_EQ(openDescriptors(), before);
}

TEST_F(Download, EachStepIsTold) {
  download();
  std::vector<Logged> lines = capture.lines();
  lines.erase(lines.begin(), lines.begin() + 8);
  EXPECT_THAT(
      lines,
      ElementsAre(Logged{5, "OPENED the curl library to download from internet"},
                  Logged{5, "Found curl_version function"}, Logged{5, "Curl version = libcurl/0"},
                  Logged{5, "execute function curl_global_init in curl so"},
                  Logged{5, "initialized the curl library to download from internet"},
                  Logged{5, std::string("Sending the URI ") + URI + " to the Curl library"},
                  Logged{5, "Found the function curl_easy_cleanup in curl so"},
                  Logged{5, "Successfully closed curl so"}));
}

TEST_F(Download, AUriWithoutASlashHasNoFileName) {
  for (const std::string uri : {"image.fw", " ", "%2e%2e", "http:", "..fw", ""}) {
    capture.forget();
    EXPECT_EQ(download(uri), uri);
    EXPECT_TRUE(capture.has(3, "ERROR: Could not parse the URI to get the firmware file name"));
  }
  EXPECT_TRUE(status.is_null());
  EXPECT_FALSE(fetched);
  EXPECT_EQ(curl.openLibraries, 0);
  EXPECT_THAT(folder.files(), IsEmpty());
}

TEST_F(Download, SomebodyElsesFileOfThatNameIsNotTakenForIt) {
  const std::string elsewhere = folder.path("elsewhere");
  std::filesystem::create_directory(elsewhere);
  folder.write("elsewhere/target", "another's");
  std::filesystem::permissions(folder.path("."),
                               std::filesystem::perms::all | std::filesystem::perms::sticky_bit);
  std::filesystem::create_symlink(elsewhere + "/target", folder.path("image.fw"));
  EXPECT_EQ(download(), URI);
  EXPECT_TRUE(capture.has(3, "ERROR: Could not open the file for writing"));
  EXPECT_TRUE(status.is_null());
  EXPECT_FALSE(fetched);
  EXPECT_FALSE(called("curl_easy_perform"));
  EXPECT_EQ(folder.read("elsewhere/target"), "another's");
}

TEST_F(Download, AFileThatCannotBeWrittenEndsIt) {
  const std::size_t before = openDescriptors();
  for (const std::string name : {"", ".", ".."}) {
    capture.forget();
    EXPECT_EQ(download("http://host/" + name), name);
    EXPECT_TRUE(capture.has(3, "ERROR: Could not open the file for writing"));
  }
  EXPECT_TRUE(status.is_null());
  EXPECT_FALSE(fetched);
  EXPECT_EQ(curl.openLibraries, 0);
  EXPECT_EQ(openDescriptors(), before);
}

TEST_F(Download, NamesAreTakenAsTheyStand) {
  for (const std::string name : {"a%s%n%d.fw", "..fw", "with blank.fw", "%2e%2e", "image.fw?x=1"}) {
    EXPECT_EQ(download("http://host/../" + name), name);
    EXPECT_EQ(folder.read(name), "fetched");
  }
  EXPECT_EQ(folder.files().size(), 5u);
}

TEST_F(Download, AFailedTransferAnswersItsCodeAndLeavesItsFileToTheCaller) {
  curl.performCode = 7;
  EXPECT_EQ(download(), "image.fw");
  expectStatus(7);
  EXPECT_TRUE(fetched);
  EXPECT_TRUE(capture.has(3, "download failed 7"));
  EXPECT_TRUE(called("curl_easy_cleanup"));
  EXPECT_THAT(folder.files(), ElementsAre("image.fw"));
}

TEST_F(Download, AMalformedUriIsThePathAgain) {
  curl.performCode = 3;
  EXPECT_EQ(download("file:///no/such/image.fw"), "file:///no/such/image.fw");
  expectStatus(3);
  EXPECT_TRUE(fetched);
}

TEST_F(Download, AnInitialisationWithACodeGoesOn) {
  curl.globalInitCode = 27;
  EXPECT_EQ(download(), "image.fw");
  expectStatus(27);
  EXPECT_TRUE(capture.has(3, "unable to initalize curl"));
  EXPECT_TRUE(called("curl_easy_perform"));
  EXPECT_TRUE(fetched);
}

TEST_F(Download, WithoutAHandleThereIsNoTransferAndNoStatus) {
  curl.easyInitFails = true;
  const std::size_t before = openDescriptors();
  EXPECT_EQ(download(), "image.fw");
  EXPECT_TRUE(status.is_null());
  EXPECT_FALSE(fetched);
  EXPECT_TRUE(capture.has(3, "ERROR: Could not initialise the curl"));
  EXPECT_EQ(curl.openLibraries, 0);
  EXPECT_EQ(openDescriptors(), before);
}

TEST_F(Download, ALibraryThatDoesNotCloseIsTold) {
  curl.closeResult = -1;
  download();
  EXPECT_TRUE(capture.has(3, "UNABLE TO CLOSE DYNAMIC LIB"));
  EXPECT_TRUE(fetched);
  EXPECT_TRUE(status.is_null());
}

TEST_F(Download, TheFirstFailedOptionEndsTheTransfer) {
  const struct {
    int option;
    const char* text;
  } rows[] = {
      {CURLOPT_URL, "Error Sending the URI to the Curl library 48"},
      {CURLOPT_WRITEFUNCTION, "Error Sending the CURLOPT_FILE to the Curl library 48"},
      {CURLOPT_FILE, "Error Sending the CURLOPT_FILE to the Curl library 48"},
      {CURLOPT_ERRORBUFFER, "Error Sending the CURLOPT_ERRORBUFFER to the Curl library 48"},
      {CURLOPT_SSL_VERIFYPEER, "Error setting CURLOPT_SSL_VERIFYPEER in the Curl library 48"},
      {CURLOPT_SSL_VERIFYHOST, "Error setting CURLOPT_SSL_VERIFYHOST in the Curl library 48"},
  };
  std::size_t set = 0;
  for (const auto& row : rows) {
    curl.optionCodes = {{row.option, 48}};
    curl.options.clear();
    capture.forget();
    fetched = false;
    EXPECT_EQ(download(), "image.fw") << row.text;
    expectStatus(48);
    EXPECT_TRUE(capture.has(3, row.text)) << row.text;
    EXPECT_EQ(curl.options.size(), ++set);
    EXPECT_TRUE(fetched);
  }
  EXPECT_FALSE(called("curl_easy_perform"));
  EXPECT_EQ(folder.read("image.fw"), "");
}

// ---- Missing functions ----

struct Missing_Row {
  const char* function;
  std::uint32_t status;  ///< 0: none
  bool transfers;
  bool fetched;
  std::vector<std::string> texts;
};

void PrintTo(const Missing_Row& row, std::ostream* out) {
  *out << row.function;
}

class Download_Without : public Download, public testing::WithParamInterface<Missing_Row> {};

TEST_P(Download_Without, TheFunction) {
  const Missing_Row& row = GetParam();
  curl.missing = {row.function};
  const std::size_t before = openDescriptors();
  EXPECT_EQ(download(), "image.fw");
  if (row.status != 0) expectStatus(row.status);
  EXPECT_EQ(status.is_null(), row.status == 0);
  EXPECT_EQ(called("curl_easy_perform"), row.transfers);
  EXPECT_EQ(fetched, row.fetched);
  EXPECT_EQ(folder.read("image.fw"), row.transfers ? "fetched" : "");
  for (const std::string& text : row.texts) EXPECT_TRUE(capture.has(3, text)) << text;
  std::size_t errors = 0;
  for (const Logged& line : capture.lines()) errors += line.level == 3 ? 1 : 0;
  EXPECT_EQ(errors, row.texts.size());
  EXPECT_EQ(curl.openLibraries, 0);
  EXPECT_EQ(openDescriptors(), before);
}

INSTANTIATE_TEST_SUITE_P(
    EachInTurn, Download_Without,
    testing::Values(Missing_Row{"curl_version", 0, true, true, {}},
                    Missing_Row{"curl_global_init",
                                4,
                                false,
                                false,
                                {"unable to locate function curl_global_init in curl so",
                                 "unable to locate function curl_easy_init in curl so"}},
                    Missing_Row{"curl_easy_init",
                                4,
                                false,
                                false,
                                {"unable to locate function curl_easy_init in curl so"}},
                    Missing_Row{"curl_easy_setopt",
                                4,
                                false,
                                true,
                                {"unable to locate function curl_easy_setopt in curl so"}},
                    Missing_Row{"curl_easy_perform",
                                4,
                                false,
                                true,
                                {"unable to locate function curl_easy_perform in curl so"}},
                    Missing_Row{"curl_easy_cleanup",
                                4,
                                true,
                                true,
                                {"unable to locate function curl_easy_cleanup in curl so"}},
                    Missing_Row{"curl_global_cleanup",
                                0,
                                true,
                                true,
                                {"could not locate curl_global_cleanup in libcurl"}}));

TEST_F(Download, AMissingHandleFunctionTellsTheLinkersError) {
  curl.missing = {"curl_easy_init"};
  download();
  EXPECT_TRUE(
      capture.has(5, "A dynamic linking error occurred:(undefined symbol: curl_easy_init)"));
}

TEST_F(Download, WithoutTheCleanupTheLibraryIsClosedAllTheSame) {
  curl.missing = {"curl_easy_cleanup"};
  download();
  EXPECT_FALSE(called("curl_global_cleanup"));
  EXPECT_TRUE(capture.has(5, "Successfully closed curl so"));
}

}  // namespace
}  // namespace cimrt
