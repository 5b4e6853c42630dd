/* An SNIA library with three adapters. */
#include "rmapi/snia_hba.h"

HBA_UINT32 HBA_GetNumberOfAdapters(void) {
  return 3;
}
void HBA_CloseAdapter(HBA_HANDLE handle) {
  (void)handle;
}
