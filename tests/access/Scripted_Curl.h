// A libcurl made of functions of the test, below the dynamic linker.
#pragma once

#include <array>
#include <cstdarg>
#include <cstdint>
#include <cstdio>
#include <cstring>
#include <map>
#include <set>
#include <string>
#include <vector>

#include "access/TVX_CurlLibrary.h"

namespace tvx::test {

/// Every function that a transfer looks up.
inline constexpr std::array<const char*, 7> CURL_FUNCTIONS = {
    "curl_version",      "curl_global_init",  "curl_easy_init",      "curl_easy_setopt",
    "curl_easy_perform", "curl_easy_cleanup", "curl_global_cleanup",
};

/// Stands in for the dynamic linker while it lives. At first libcurl opens by its name alone, has
/// all functions, and fetches `body`. One object at a time.
class Scripted_Curl {
 public:
  Scripted_Curl() {
    current() = this;
    static constexpr cimrt::TVX_Dl_Operations OPERATIONS = {&open, &symbol, &close, &error};
    cimrt::setDlOperations(&OPERATIONS);
  }
  ~Scripted_Curl() {
    cimrt::setDlOperations(nullptr);
    current() = nullptr;
  }
  Scripted_Curl(const Scripted_Curl&) = delete;
  Scripted_Curl& operator=(const Scripted_Curl&) = delete;

  // The script.
  std::string present = "libcurl.so";  ///< the only file that opens
  std::set<std::string> missing;       ///< functions that it does not have
  std::map<int, int> optionCodes;      ///< answers of `curl_easy_setopt` other than 0
  std::size_t failingOption = 0;       ///< the so many-th `curl_easy_setopt` answers 43; 0: none
  int globalInitCode = 0;
  bool easyInitFails = false;
  int performCode = 0;
  int closeResult = 0;
  std::string body = "fetched";

  // What happened.
  std::vector<std::string> opened;   ///< files, each with its mode
  std::vector<std::string> options;  ///< "number=value"
  std::vector<std::string> calls;    ///< functions of the library that ran, without setopt
  std::string uploaded;
  int openLibraries = 0;

 private:
  static Scripted_Curl*& current() {
    static Scripted_Curl* object = nullptr;
    return object;
  }

  static void* open(const char* file, int mode) {
    Scripted_Curl& self = *current();
    self.opened.push_back(std::string(file) + " " + std::to_string(mode));
    self._error = self.present == file ? "" : "no such library";
    if (self.present != file) return nullptr;
    self.openLibraries++;
    return &self;
  }
  static int close(void*) {
    current()->openLibraries--;
    return current()->closeResult;
  }
  static const char* error() {
    Scripted_Curl& self = *current();
    self._told = self._error;
    self._error.clear();
    return self._told.empty() ? nullptr : self._told.c_str();
  }
  static void* symbol(void*, const char* name) {
    Scripted_Curl& self = *current();
    static const std::map<std::string, void*> FUNCTIONS = {
        {"curl_version", reinterpret_cast<void*>(&version)},
        {"curl_global_init", reinterpret_cast<void*>(&globalInit)},
        {"curl_easy_init", reinterpret_cast<void*>(&easyInit)},
        {"curl_easy_setopt", reinterpret_cast<void*>(&setOption)},
        {"curl_easy_perform", reinterpret_cast<void*>(&perform)},
        {"curl_easy_cleanup", reinterpret_cast<void*>(&easyCleanup)},
        {"curl_global_cleanup", reinterpret_cast<void*>(&globalCleanup)},
    };
    const bool there = self.missing.count(name) == 0 && FUNCTIONS.count(name) != 0;
    self._error = there ? "" : std::string("undefined symbol: ") + name;
    return there ? FUNCTIONS.at(name) : nullptr;
  }

  static const char* version() {
    current()->calls.emplace_back("curl_version");
    return "libcurl/0";
  }
  static int globalInit(long flags) {
    current()->calls.push_back("curl_global_init " + std::to_string(flags));
    return current()->globalInitCode;
  }
  static void globalCleanup() { current()->calls.emplace_back("curl_global_cleanup"); }
  static void* easyInit() {
    current()->calls.emplace_back("curl_easy_init");
    return current()->easyInitFails ? nullptr : current();
  }
  static void easyCleanup(void*) { current()->calls.emplace_back("curl_easy_cleanup"); }

  static int setOption(void*, int option, ...) {
    Scripted_Curl& self = *current();
    va_list arguments;
    va_start(arguments, option);
    std::string value = "pointer";
    if (option < 10000) {
      value = std::to_string(va_arg(arguments, long));
    } else if (option >= 30000) {
      value = std::to_string(va_arg(arguments, std::int64_t));
    } else if (option >= 20000) {
      self._writer = va_arg(arguments, cimrt::Curl_Write_Function);
    } else {
      void* const pointer = va_arg(arguments, void*);
      if (option == cimrt::CURLOPT_URL || option == cimrt::CURLOPT_USERPWD)
        value = static_cast<const char*>(pointer);
      if (option == cimrt::CURLOPT_FILE || option == cimrt::CURLOPT_READDATA)
        self._stream = static_cast<std::FILE*>(pointer);
      if (option == cimrt::CURLOPT_ERRORBUFFER) value = bufferState(pointer);
    }
    va_end(arguments);
    self.options.push_back(std::to_string(option) + "=" + value);
    if (self.options.size() == self.failingOption) return 43;
    const auto code = self.optionCodes.find(option);
    return code != self.optionCodes.end() ? code->second : 0;
  }
  /// "cleared" if all 512 bytes are.
  static std::string bufferState(const void* buffer) {
    static constexpr std::array<char, 512> CLEARED{};
    return std::memcmp(buffer, CLEARED.data(), CLEARED.size()) == 0 ? "cleared" : "dirty";
  }

  static int perform(void*) {
    Scripted_Curl& self = *current();
    self.calls.emplace_back("curl_easy_perform");
    if (self._writer) {
      std::string data = self.body;
      if (self._writer(data.data(), 1, data.size(), self._stream) != data.size()) return 23;
    } else {
      for (int c = std::fgetc(self._stream); c != EOF; c = std::fgetc(self._stream))
        self.uploaded += static_cast<char>(c);
    }
    return self.performCode;
  }

  std::string _error;
  std::string _told;
  cimrt::Curl_Write_Function _writer = nullptr;
  std::FILE* _stream = nullptr;
};

}  // namespace tvx::test
