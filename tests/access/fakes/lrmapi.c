/* The present management library, with three of its functions. */
#include "rmapi/rmapi.h"

RM_STATUS LRM_InitLib(void) {
  return 0;
}
RM_STATUS LRM_GetDriverType(HBA_WWN wwpn, uint32_t* type) {
  *type = wwpn.wwn[7];
  return 0;
}
RM_STATUS RM_MiliVersion(char* text, uint32_t size) {
  const char version[] = "present";
  for (uint32_t i = 0; i < sizeof version && i < size; ++i) text[i] = version[i];
  return 0;
}
