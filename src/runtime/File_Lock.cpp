#include "runtime/File_Lock.h"

#include <unistd.h>

#include <cerrno>

#include "runtime/Safe_Open.h"

namespace cimrt {
namespace {

constexpr mode_t LOCK_PERMISSIONS = 0600;

/// A request over the whole file.
struct flock whole_file(short type) {
  struct flock request = {};
  request.l_type = type;
  request.l_whence = SEEK_SET;
  return request;
}

}  // namespace

File_Lock::File_Lock(const char* path)
    : _lock(whole_file(F_WRLCK)),
      _unlock(whole_file(F_UNLCK)),
      _fd(open_descriptor(path, LOCK_PERMISSIONS)) {}

File_Lock::~File_Lock() {
  if (usable()) ::close(_fd);
}

void File_Lock::apply(struct flock& request) {
  if (!usable()) return;
  while (fcntl(_fd, F_SETLKW, &request) == -1 && errno == EINTR) {
  }
}

void File_Lock::lock() {
  apply(_lock);
}

void File_Lock::unlock() {
  apply(_unlock);
}

}  // namespace cimrt
