#include "common/TVX_Replace_File.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <climits>
#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <sstream>

#include "common/TVX_File.h"
#include "runtime/Safe_Open.h"

namespace cimrt {

namespace {

/// The file behind all links; the path itself if there is no file yet.
std::string resolved(const std::string& path) {
  char* found = ::realpath(path.c_str(), nullptr);
  if (found == nullptr) return path;
  std::string result = found;
  std::free(found);
  return result;
}

/// Writes everything down to the disk. What fails may leave a part of the text.
bool fill(TVX_File stream, const std::string& text) {
  std::FILE* const out = stream.get();
  const bool written = std::fwrite(text.data(), 1, text.size(), out) == text.size() &&
                       std::fflush(out) == 0 && (::fsync(::fileno(out)) == 0 || errno == EINVAL);
  return std::fclose(stream.release()) == 0 && written;
}

TVX_File openForWriting(const std::string& path, mode_t permissions) {
  return TVX_File(open_for_writing(path.c_str(), "w", permissions));
}

std::string contentsOf(const std::string& path) {
  std::ostringstream text;
  text << std::ifstream(path, std::ios::binary).rdbuf();
  return text.str();
}

Replace_Result rewriteInPlace(const std::string& path, const std::string& text, bool isRegular,
                              mode_t permissions) {
  const std::string before = isRegular ? contentsOf(path) : std::string();
  TVX_File stream = openForWriting(path, permissions);
  if (!stream) return Replace_Result::NOT_OPENED;
  if (fill(std::move(stream), text)) return Replace_Result::WRITTEN;
  if (isRegular)
    if (TVX_File again = openForWriting(path, permissions)) fill(std::move(again), before);
  return Replace_Result::NOT_WRITTEN;
}

/// Gives the stream's file the mode and owner of the one that it is to replace.
bool copyRights(std::FILE* stream, const struct stat& from) {
  const int fd = ::fileno(stream);
  struct stat own {};
  if (::fstat(fd, &own) != 0) return false;
  const bool sameOwner = own.st_uid == from.st_uid && own.st_gid == from.st_gid;
  return (sameOwner || ::fchown(fd, from.st_uid, from.st_gid) == 0) &&
         ::fchmod(fd, from.st_mode & 07777) == 0;
}

}  // namespace

Replace_Result tvxReplaceFile(const std::string& path, const std::string& text,
                              mode_t permissions) {
  const std::string target = resolved(path);
  struct stat info {};
  const bool exists = ::stat(target.c_str(), &info) == 0;
  const bool isRegular = exists && S_ISREG(info.st_mode);
  if (exists && !isRegular) return rewriteInPlace(target, text, false, permissions);
  if (exists && ::faccessat(AT_FDCWD, target.c_str(), W_OK, AT_EACCESS) != 0)
    return Replace_Result::NOT_OPENED;
  const std::string aside = target + ".new";
  TVX_File stream = openForWriting(aside, permissions);
  if (!stream) return rewriteInPlace(target, text, isRegular, permissions);
  if (exists && !copyRights(stream.get(), info)) {
    stream.reset();
    ::unlink(aside.c_str());
    return rewriteInPlace(target, text, isRegular, permissions);
  }
  if (fill(std::move(stream), text) && ::rename(aside.c_str(), target.c_str()) == 0)
    return Replace_Result::WRITTEN;
  ::unlink(aside.c_str());
  return Replace_Result::NOT_WRITTEN;
}

}  // namespace cimrt
