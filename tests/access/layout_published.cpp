// What the published SNIA header says of the records. It may not meet this project's own header in
// one unit, so the numbers cross over as a list.
// clang-format off
#include <ctime>  // the published header uses struct tm without it
#include <hbaapi.h>
// clang-format on

#include "layout.h"

namespace tvx::test {

std::vector<Layout> publishedLayouts() {
  return {TVX_SNIA_LAYOUTS};
}

}  // namespace tvx::test
