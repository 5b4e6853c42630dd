// Write lock on a file, held between processes. Internal to the runtime.
#pragma once

#include <fcntl.h>

namespace cimrt {

/// Opens the lock file, making it if need be, for its own life; where everybody may make files,
/// only one of this user's own. Not for several threads at a time.
class File_Lock {
 public:
  explicit File_Lock(const char* path);
  ~File_Lock();
  File_Lock(const File_Lock&) = delete;
  File_Lock& operator=(const File_Lock&) = delete;

  /// False if the file could not be opened: the other operations do nothing then.
  bool usable() const { return _fd >= 0; }
  void lock();  ///< waits for other processes
  void unlock();

 private:
  void apply(struct flock& request);

  struct flock _lock;
  struct flock _unlock;
  int _fd;
};

}  // namespace cimrt
