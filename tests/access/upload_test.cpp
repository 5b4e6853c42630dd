// Files to URIs, step by step over a scripted libcurl.
#include <dlfcn.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/stat.h>

#include "Scripted_Curl.h"
#include "access/TVX_MethodWrapper.h"
#include "support/Log_Capture.h"
#include "support/Working_Folder.h"

namespace cimrt {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;
using tvx::test::Log_Capture;
using tvx::test::Logged;
using tvx::test::openDescriptors;
using tvx::test::Scripted_Curl;
using tvx::test::Working_Folder;

class Upload : public testing::Test {
 protected:
  Upload() { folder.write("table.xml", "<content/>"); }

  int upload(const char* path = "table.xml") {
    return TVX_MethodWrapper::uploadFileUsingCurl(String("http://host/table.xml"), path);
  }
  bool called(const std::string& function) const {
    return std::count(curl.calls.begin(), curl.calls.end(), function) != 0;
  }

  Working_Folder folder;
  Scripted_Curl curl;
  Log_Capture capture;
};

TEST_F(Upload, TheFileIsSentWithItsSize) {
  const std::size_t before = openDescriptors();
  EXPECT_EQ(upload(), 0);
  EXPECT_EQ(curl.uploaded, "<content/>");
  EXPECT_THAT(curl.options, ElementsAre("46=1", "54=1", "10002=http://host/table.xml",
                                        "10009=pointer", "10009=pointer", "13=100", "14=10",
                                        "30115=10", "64=0", "81=0", "10005=:", "107=1"));
  EXPECT_THAT(curl.calls,
              ElementsAre("curl_version", "curl_global_init 3", "curl_easy_init",
                          "curl_easy_perform", "curl_easy_cleanup", "curl_global_cleanup"));
  EXPECT_EQ(curl.openLibraries, 0);
  EXPECT_EQ(openDescriptors(), before);
}

TEST_F(Upload, EachStepIsTold) {
  upload();
  EXPECT_THAT(
      capture.lines(),
      ElementsAre(Logged{5, "Inside TVX_MethodWrapper::uploadFileUsingCurl"},
                  Logged{5, "Searching for /lib Curl on the machine"},
                  Logged{5, "dlopen returned for /lib/libcurl.so.4 = no such library\n"},
                  Logged{5, "Searching for /usr/lib/ Curl on the machine"},
                  Logged{5, "dlopen returned for /usr/lib/libcurl.so.4 = no such library\n"},
                  Logged{5, "Checking with libcurl.so system location for libcurl"},
                  Logged{5, "dlopen returned for libcurl.so = \n"},
                  Logged{5, "Found curl_version function"}, Logged{5, "Curl version = libcurl/0"},
                  Logged{5, "execute function curl_global_init in curl so"},
                  Logged{5, "iFileSize size:: 10"},
                  Logged{5, "URI.value.c_str(): http://host/table.xml"},
                  Logged{5, "Successfully Set CURLOPT_UPLOAD = 0"}));
}

TEST_F(Upload, TheLibraryIsSearchedInItsOwnOrder) {
  curl.present = "none";
  EXPECT_EQ(upload(), -1);
  const std::string mode = " " + std::to_string(RTLD_NOW | RTLD_GLOBAL);
  EXPECT_THAT(curl.opened, ElementsAre("/lib/libcurl.so.4" + mode, "/usr/lib/libcurl.so.4" + mode,
                                       "libcurl.so" + mode, "curl.dll" + mode));
  EXPECT_TRUE(capture.has(5, "Checking with curl.dll windows system location for libcurl"));
  EXPECT_TRUE(capture.has(3, "ERROR: Could not load the curl library "));
  EXPECT_TRUE(capture.has(5, "couldnot initialize curl library"));
}

TEST_F(Upload, TheLibraryUnderItsOtherNameServesToo) {
  curl.present = "curl.dll";
  EXPECT_EQ(upload(), 0);
  EXPECT_EQ(curl.uploaded, "<content/>");
}

TEST_F(Upload, AFileThatIsNotThereIsNotSent) {
  EXPECT_EQ(upload("other.xml"), -1);
  EXPECT_EQ(upload(nullptr), -1);
  EXPECT_TRUE(capture.has(5, "couldnot locate the file other.xml, to be uploaded"));
  EXPECT_THAT(curl.opened, IsEmpty());
}

TEST_F(Upload, AFileThatCannotBeOpenedAnswersOne) {
  // A socket has a state but can't be opened, not even by root.
  ASSERT_EQ(::mknod("socket", S_IFSOCK | 0600, 0), 0);
  EXPECT_EQ(upload("socket"), 1);
  EXPECT_FALSE(called("curl_easy_perform"));
  EXPECT_TRUE(called("curl_easy_cleanup"));
  EXPECT_EQ(curl.openLibraries, 0);
}

TEST_F(Upload, ALibraryThatDoesNotInitialiseEndsIt) {
  curl.globalInitCode = 2;
  EXPECT_EQ(upload(), -1);
  EXPECT_TRUE(capture.has(3, "unable to initalize curl"));
  curl.globalInitCode = 0;
  curl.easyInitFails = true;
  EXPECT_EQ(upload(), -1);
  EXPECT_TRUE(capture.has(3, "ERROR: Could not initialise the curl"));
  EXPECT_EQ(capture.count(5, "couldnot initialize curl library"), 2u);
  EXPECT_FALSE(called("curl_easy_perform"));
  EXPECT_EQ(curl.openLibraries, 0);
}

TEST_F(Upload, AFailedTransferIsToldAndClosed) {
  const std::size_t before = openDescriptors();
  curl.performCode = 28;
  EXPECT_EQ(upload(), -1);
  EXPECT_TRUE(capture.has(3, "curl upload file failed, errorcode 28"));
  EXPECT_TRUE(called("curl_easy_cleanup"));
  EXPECT_EQ(openDescriptors(), before);
}

TEST_F(Upload, ALibraryThatDoesNotCloseIsTold) {
  curl.closeResult = -1;
  EXPECT_EQ(upload(), 0);
  EXPECT_TRUE(capture.has(3, "UNABLE TO CLOSE DYNAMIC LIB"));
}

TEST_F(Upload, TheFirstFailedOptionEndsIt) {
  const struct {
    int option;
    std::size_t set;
    const char* text;
  } rows[] = {
      {CURLOPT_UPLOAD, 1, "Error Setting CURLOPT_UPLOAD, errorcode = 43"},
      {CURLOPT_PUT, 2, "Error setting the CURLOPT_PUT,error code 43"},
      {CURLOPT_URL, 3, "Error setting the CURLOPT_URL,error code 43"},
      {CURLOPT_READDATA, 4, "Error Setting CURLOPT_READDATA, errorcode = 43"},
      {CURLOPT_TIMEOUT, 6, "Error Setting CURLOPT_TIMEOUT, errorcode = 43"},
      {CURLOPT_INFILESIZE, 7, "Error Setting CURLOPT_INFILESIZE, errorcode = 43"},
      {CURLOPT_INFILESIZE_LARGE, 8, "Error Setting CURLOPT_INFILESIZE_LARGE, errorcode = 43"},
      {CURLOPT_SSL_VERIFYPEER, 9,
       "Error setting CURLOPT_SSL_VERIFYPEER in the Curl library, errorcode 43"},
      {CURLOPT_SSL_VERIFYHOST, 10, "Error setting CURLOPT_SSL_VERIFYHOST in the Curl library 43"},
      {CURLOPT_USERPWD, 11, "Error setting CURLOPT_USERPWD in the Curl library 43"},
      {CURLOPT_HTTPAUTH, 12, "Error setting CURLOPT_USERPWD in the Curl library 43"},
  };
  const std::size_t before = openDescriptors();
  for (const auto& row : rows) {
    curl.optionCodes = {{row.option, 43}};
    curl.options.clear();
    capture.forget();
    EXPECT_EQ(upload(), -1) << row.text;
    EXPECT_TRUE(capture.has(3, row.text)) << row.text;
    EXPECT_EQ(curl.options.size(), row.set) << row.text;
  }
  EXPECT_FALSE(called("curl_easy_perform"));
  EXPECT_EQ(openDescriptors(), before);
}

TEST_F(Upload, TheFileAsInputIsAnOptionOfItsOwn) {
  curl.failingOption = 5;  // its number is that of the data before it
  EXPECT_EQ(upload(), -1);
  EXPECT_TRUE(capture.has(3, "Error Setting CURLOPT_INFILE, errorcode = 43"));
  EXPECT_EQ(curl.options.size(), 5u);
  EXPECT_FALSE(called("curl_easy_perform"));
}

TEST_F(Upload, EachMissingFunctionHasItsText) {
  const struct {
    const char* function;
    int result;
    const char* text;  ///< null: none
  } rows[] = {
      {"curl_version", 0, nullptr},
      {"curl_global_init", -1, "unable to locate function curl_global_init in curl so"},
      {"curl_easy_init", -1, "unable to locate function curl_easy_init in curl so"},
      {"curl_easy_setopt", -1, "unable to locate function curl_easy_setopt in curl so"},
      {"curl_easy_perform", -1, "dlsym, couldnot locate the symbol curl_easy_perform"},
      {"curl_easy_cleanup", 0, "unable to locate function curl_easy_cleanup in curl so"},
      {"curl_global_cleanup", 0, "could not locate curl_global_cleanup in libcurl"},
  };
  for (const auto& row : rows) {
    curl.missing = {row.function};
    curl.uploaded.clear();
    capture.forget();
    EXPECT_EQ(upload(), row.result) << row.function;
    if (row.text) {
      EXPECT_TRUE(capture.has(3, row.text)) << row.function;
    }
    EXPECT_EQ(curl.uploaded, row.result == 0 ? "<content/>" : "") << row.function;
    EXPECT_EQ(curl.openLibraries, 0) << row.function;
  }
}

TEST_F(Upload, TheTeardownGoesOnWithoutOneOfItsFunctions) {
  curl.missing = {"curl_easy_cleanup"};
  upload();
  EXPECT_TRUE(called("curl_global_cleanup"));
  EXPECT_TRUE(
      capture.has(5, "A dynamic linking error occurred:(undefined symbol: curl_easy_cleanup)"));
}

}  // namespace
}  // namespace cimrt
