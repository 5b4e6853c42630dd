#include "cli/Firmware.h"

#include <fmt/format.h>

#include <algorithm>
#include <cctype>
#include <filesystem>

#include "cli/ServiceCalls.h"

namespace tvx::host {
namespace {

struct ResultWords {
  std::uint64_t result;
  const char* words;
};

constexpr ResultWords results[] = {
    {0, "the firmware is installed"},
    {4, "the service is the wrong one, or the image cannot be written to a file"},
    {5, "an install option is wrong, or the file cannot be looked at"},
    {4097, "no port or no file was named"},
    {4107, "the firmware file is not available"},
    {32774, "out of memory"},
    {32968, "the port is not known to the service"},
    {33068, "the installation service is not known"},
    {40001, "the adapter's library failed, or does not know the port as a local one"},
    {40148, "the adapter's mailbox failed: internal driver error"},
    {40149, "the adapter's mailbox timed out"},
    {40150, "the adapter's mailbox is busy; try again"},
    {waitsForReboot, "the firmware is on flash; reboot the system to activate it"},
};

}  // namespace

std::string installationWords(std::uint64_t result) {
  const auto* const row =
      std::find_if(std::begin(results), std::end(results),
                   [&](const ResultWords& each) { return each.result == result; });
  if (row != std::end(results)) {
    return row->words;
  }
  if (result > libraryFailure) {
    return fmt::format("the adapter's library answered status {}", result - libraryFailure);
  }
  return "an answer that has no meaning here";
}

bool isRemote(const std::string& fileOrUri) {
  const std::size_t colon = fileOrUri.find("://");
  if (colon == std::string::npos || colon == 0 || fileOrUri.starts_with("file://")) {
    return false;
  }
  return std::all_of(fileOrUri.begin(), fileOrUri.begin() + static_cast<std::ptrdiff_t>(colon),
                     [](unsigned char c) { return std::isalnum(c) != 0 || c == '+' || c == '-'; });
}

std::string localPath(const std::string& fileOrUri) {
  for (const std::string prefix : {"file://localhost", "file://"}) {
    if (fileOrUri.starts_with(prefix + "/")) {
      return fileOrUri.substr(prefix.size());
    }
  }
  return std::filesystem::absolute(fileOrUri).string();
}

std::string shownUri(const std::string& fileOrUri) {
  const std::size_t at = fileOrUri.rfind('@');
  if (!isRemote(fileOrUri) || at == std::string::npos) {
    return fileOrUri;
  }
  const std::size_t colon = fileOrUri.find(':', fileOrUri.find("://") + 3);
  return colon < at ? fileOrUri.substr(0, colon + 1) + "***" + fileOrUri.substr(at) : fileOrUri;
}

}  // namespace tvx::host
