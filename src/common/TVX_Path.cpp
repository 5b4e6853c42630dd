#include "common/TVX_Path.h"

#include <cstdlib>

namespace cimrt {

std::string tvxPath(const char* absolute) {
  const char* root = ::secure_getenv("TVX_ROOT");
  std::string path = root != nullptr ? root : "";
  if (absolute != nullptr) path += absolute;
  return path;
}

}  // namespace cimrt
