// Opening the files that the library itself writes. Internal to the provider.
#pragma once

#include <sys/types.h>

#include <cstdio>

namespace cimrt {

/// Permissions of a log: its owner writes, its group reads.
inline constexpr mode_t LOG_PERMISSIONS = 0640;
/// Permissions of a settings file: everybody may read it.
inline constexpr mode_t SETTINGS_PERMISSIONS = 0644;

/// Opens a stream on a file that is to be written; `mode` is "w", "a" or "a+". A file that is made
/// gets `permissions`, less the process's mask, and no child process inherits it. In a folder where
/// everybody may make files, such as /tmp, only a plain file of this user's own is opened: no link,
/// nothing that somebody else has put there. A pipe that nobody reads is no file to write to, and
/// the call never waits for a reader. Answers null, with `errno` set, on failure; the caller closes
/// the stream.
std::FILE* open_for_writing(const char* path, const char* mode, mode_t permissions);

/// The same as a descriptor for a file whose contents do not matter: it is made if need be, and
/// left as it is. Answers -1, with `errno` set, on failure; the caller closes the descriptor.
int open_descriptor(const char* path, mode_t permissions);

}  // namespace cimrt
