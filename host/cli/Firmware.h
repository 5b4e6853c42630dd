// What the firmware commands know of the installation service.
#pragma once

#include <cstdint>
#include <string>

namespace tvx::host {

/// `FWDownloadStatus` of a port whose firmware waits for a reboot.
inline constexpr std::uint64_t waitsForReboot = 40247;

/// The result of an installation in words, without its number.
std::string installationWords(std::uint64_t result);

/// True for "scheme://..." with a scheme other than "file".
bool isRemote(const std::string& fileOrUri);

/// The local path that a file URI or a path names, made absolute.
std::string localPath(const std::string& fileOrUri);

/// A URI as it may be shown: three stars in place of the password, up to the last "@".
std::string shownUri(const std::string& fileOrUri);

}  // namespace tvx::host
