/* The older management library: the shorter names. */
#include "rmapi/rmapi.h"

RM_STATUS RM_InitLib(void);
RM_STATUS RM_ChangeWWN(HBA_WWN wwpn, HBA_WWN newWwpn, HBA_WWN newWwnn, uint32_t type,
                       uint32_t* operationStatus);

RM_STATUS RM_InitLib(void) {
  return 0;
}
RM_STATUS RM_ChangeWWN(HBA_WWN wwpn, HBA_WWN newWwpn, HBA_WWN newWwnn, uint32_t type,
                       uint32_t* operationStatus) {
  *operationStatus = (uint32_t)(wwpn.wwn[0] + newWwpn.wwn[0] + newWwnn.wwn[0]) + type;
  return 0;
}
