/* PCI configuration registers of an adapter port, as the adapter management library hands them out.
 *
 * The layout is this project's: the library's own is not published. A common header comes first;
 * what follows it depends on the chip family that `pciType` names. Registers stand in the host's
 * byte order. */
#ifndef TVX_RMAPI_PCI_H
#define TVX_RMAPI_PCI_H

#include <stdint.h>

#ifdef __cplusplus
extern "C" {
#endif

/* Chip families. 0 is none: only the header is filled. Every number above 4 is of the last family.
 */
enum {
  RM_PCI_NONE = 0,
  RM_PCI_TAMIROL = 1,
  RM_PCI_KORA = 2,
  RM_PCI_VESTRA = 3,
  RM_PCI_ONDREL = 4,
  RM_PCI_BRISCA = 5
};

/* The header that all families share: the registers of a PCI type 0 header. */
typedef struct RM_PCIHeader {
  uint32_t pciType; /* RM_PCI_... */
  uint16_t vendorId;
  uint16_t deviceId;
  uint16_t command;
  uint16_t status;
  uint8_t revisionId;
  uint8_t progIf;
  uint8_t subClass;
  uint8_t baseClass;
  uint8_t cacheLineSize;
  uint8_t latencyTimer;
  uint8_t headerType;
  uint8_t builtInSelfTest;
  uint32_t baseAddresses[6];
  uint32_t cis;
  uint16_t subVendorId;
  uint16_t subsystemId;
  uint32_t expansionROMBaseAddress;
  uint8_t capabilitiesPtr;
  uint8_t interruptLine;
  uint8_t interruptPin;
  uint8_t minimumGrant;
  uint8_t maximumLatency;
  uint8_t reserved[3];
} RM_PCIHeader;

/* Power management and message signalled interrupts. */
typedef struct RM_PCIPower {
  uint32_t pwrMgtCaps;
  uint32_t pwrMgtCtrl;
  uint32_t msiCtrl;
  uint32_t msiLowAddr;
  uint32_t msiHighAddr;
  uint32_t msiData;
} RM_PCIPower;

/* PCI Express capability. */
typedef struct RM_PCIExpress {
  uint32_t cap;
  uint32_t deviceCap;
  uint32_t deviceStatusCtrl;
  uint32_t linkCap;
  uint32_t linkStatusCtrl;
} RM_PCIExpress;

/* Vital product data access. */
typedef struct RM_PCIVpd {
  uint32_t addr;
  uint32_t data;
} RM_PCIVpd;

/* Tamirol, Kora and Vestra. The ECC registers exist on Vestra alone, hot swap not on Tamirol. */
typedef struct RM_PCIXFamily {
  uint32_t featureEnable;
  uint32_t pcixCommand;
  uint32_t pcixStatus;
  uint32_t eccControlStatus;
  uint32_t eccFirstAddress;
  uint32_t eccSecondAddress;
  uint32_t eccAttribute;
  RM_PCIPower power;
  RM_PCIVpd vpd;
  uint32_t hotSwap;
} RM_PCIXFamily;

/* Ondrel. */
typedef struct RM_PCIOndrelFamily {
  uint32_t featureEnable;
  RM_PCIExpress express;
  RM_PCIVpd vpd;
  RM_PCIPower power;
} RM_PCIOndrelFamily;

/* Brisca and later. */
typedef struct RM_PCIBriscaFamily {
  uint32_t msiMaskBits;
  uint32_t msiPendingBits;
  uint32_t msixCtrl;
  uint32_t msixTableOffset;
  uint32_t msixPBAOffset;
  uint32_t vpdAddr;
  RM_PCIExpress express;
  uint32_t slotCap;
  uint32_t slotStatusCtrlReg;
  uint32_t rootCapCtrlReg;
  uint32_t rootStatusReg;
  uint32_t deviceCap2Reg;
  uint32_t deviceStatusCtl2Reg;
  uint32_t linkCap2Reg;
  uint32_t linkStatus2Ctl2Reg;
  uint32_t slotCap2Reg;
  uint32_t slotStatusCtl2Reg;
  RM_PCIPower power;
  uint32_t enhancedCapHdrAER;
  uint32_t uncorrectableErrStat;
  uint32_t uncorrectableErrMask;
  uint32_t uncorrectableErrSeverity;
  uint32_t correctableErrStat;
  uint32_t correctableErrMask;
  uint32_t advErrCapCtl;
  uint32_t headerLog[4];
  uint32_t enhancedCapHdrPBUDG;
  uint32_t dataSelectReg;
  uint32_t dataReg;
  uint32_t powerBudget;
} RM_PCIBriscaFamily;

typedef struct RM_PCIRegisters {
  RM_PCIHeader header;
  union {
    RM_PCIXFamily pcix;
    RM_PCIOndrelFamily ondrel;
    RM_PCIBriscaFamily brisca;
    uint32_t words[128]; /* room for later families */
  } family;
} RM_PCIRegisters;

#ifdef __cplusplus
}
#endif

#endif
