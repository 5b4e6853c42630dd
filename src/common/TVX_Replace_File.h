// Rewriting small files so that a failure leaves what was there.
#pragma once

#include <sys/types.h>

#include <string>

namespace cimrt {

enum class Replace_Result {
  WRITTEN,
  NOT_OPENED,   ///< the file may not be written, or its folder is missing
  NOT_WRITTEN,  ///< the disk is full or failed; the earlier contents stand
};

/// Makes `text` the whole contents of the file. The text is written aside and takes the file's
/// place when it is complete; a file that is there keeps its mode and owner, a new one gets
/// `permissions`. Where nothing can be put aside the file is rewritten in place, and filled again
/// with what it held if that fails. A link is followed. Logs nothing.
Replace_Result tvxReplaceFile(const std::string& path, const std::string& text, mode_t permissions);

}  // namespace cimrt
