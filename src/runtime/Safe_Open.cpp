#include "runtime/Safe_Open.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <string>

namespace cimrt {
namespace {

std::string folder_of(const std::string& path) {
  const std::size_t slash = path.rfind('/');
  if (slash == std::string::npos) return ".";
  return slash == 0 ? "/" : path.substr(0, slash);
}

bool anybody_writes_in(const std::string& folder) {
  struct stat info = {};
  return ::stat(folder.c_str(), &info) == 0 && (info.st_mode & S_IWOTH) != 0;
}

/// Whether the open file is what it seems: nobody else's, under one name, and a plain file.
bool is_own_plain_file(int fd) {
  struct stat info = {};
  return ::fstat(fd, &info) == 0 && S_ISREG(info.st_mode) && info.st_uid == ::geteuid() &&
         info.st_nlink == 1;
}

int flags_of(const std::string& mode) {
  const int access = mode == "a+" ? O_RDWR : O_WRONLY;
  return access | O_CREAT | O_CLOEXEC | (mode[0] == 'a' ? O_APPEND : 0);
}

int fail(int fd, int error) {
  ::close(fd);
  errno = error;
  return -1;
}

/// Emptying comes after the look at what was opened.
int open_file(const std::string& path, const std::string& mode, mode_t permissions) {
  const bool shared = anybody_writes_in(folder_of(path));
  // A pipe that somebody put there must not keep the caller waiting.
  const int guard = O_NONBLOCK | (shared ? O_NOFOLLOW : 0);
  const int fd = ::open(path.c_str(), flags_of(mode) | guard, permissions);
  if (fd < 0) return -1;
  if (shared && !is_own_plain_file(fd)) return fail(fd, EPERM);
  if (mode == "w" && ::ftruncate(fd, 0) != 0 && errno != EINVAL) return fail(fd, errno);
  return fd;
}

}  // namespace

std::FILE* open_for_writing(const char* path, const char* mode, mode_t permissions) {
  const int fd = open_file(path, mode, permissions);
  if (fd < 0) return nullptr;
  std::FILE* stream = ::fdopen(fd, mode);
  if (stream == nullptr) ::close(fd);
  return stream;
}

int open_descriptor(const char* path, mode_t permissions) {
  return open_file(path, "a", permissions);
}

}  // namespace cimrt
