/* The adapter management library's interface as this project understands it: prototypes, status
 * values, attribute numbers and record layouts. The library itself (liblrmapi.so, older name
 * librmapi.so) is opened at run time; nothing links against it.
 *
 * Conventions of the interface:
 *  - a port is named by its HBA_WWN, by value;
 *  - RM_STATUS 0 is success, any other value a failure;
 *  - "size in and out": the caller puts the room in bytes, the library what it wrote or needs;
 *  - "count in and out": the same, in records;
 *  - an attribute block is opaque: it is only read through RM_GetAttributeValue, and the values
 * that come out of it live as long as the block;
 *  - integers are in host order, records have the layouts below, without hidden padding. */
#ifndef RMAPI_RMAPI_H
#define RMAPI_RMAPI_H

#include <stdint.h>

#include "rmapi/rmapi_pci.h"
#include "rmapi/snia_hba.h"

#ifdef __cplusplus
extern "C" {
#endif

typedef int RM_STATUS;

/* Status values that callers tell apart. */
enum {
  RM_OK = 0,
  RM_ERROR = 1,                   /* generic failure; also what a missing entry point gives */
  RM_ERROR_NOT_SUPPORTED = 2,     /* the host or the adapter can't do it */
  RM_ERROR_INVALID_POINTER = 4,   /* made by this provider: no output pointer */
  RM_ERROR_INVALID_WWN = 5,       /* RM_ValidateWwn */
  RM_ERROR_MORE_DATA = 7,         /* list too small, the count holds what is needed */
  RM_ERROR_NO_MEMORY = 8,         /* made by this provider */
  RM_ERROR_DIRECTORY = 27,        /* dump directory cannot be opened */
  RM_ERROR_DIAG_NOT_READY = 60,   /* no results yet */
  RM_ERROR_DIAG_TABLE_FULL = 62,  /* too many pending diagnostics */
  RM_ERROR_DIAG_UNAVAILABLE = 63, /* diagnostics not available */
  RM_ERROR_ADAPTER_BUSY = 64,
  RM_ERROR_WWN_NOT_SUPPORTED = 89,
  RM_ERROR_WWN_DUPLICATE = 91, /* made by this provider */
  RM_ERROR_WWN_UNAVAILABLE = 92,
  RM_ERROR_WWN_IN_PROGRESS = 97,    /* repeat the call */
  RM_ERROR_VPORT_UNSUPPORTED = 128, /* virtual ports cannot be listed on this host */
  RM_ERROR_MAILBOX_FAILED = 148,
  RM_ERROR_MAILBOX_TIMEOUT = 149,
  RM_ERROR_MAILBOX_BUSY = 150,
  RM_ERROR_CONFIG_FILE = 160,
  RM_ERROR_CONFIG_FILE_ALT = 178,
  RM_ERROR_SCSI_CHECK = 187,     /* SCSI check condition, sense data returned */
  RM_ERROR_DIAG_PORT = 190,      /* diagnostics not supported on this port */
  RM_ERROR_LIST_TOO_SMALL = 191, /* as 7, for file names, driver parameters and OAS lists */
  RM_ERROR_BOOT_CODE_ENABLED = 221,
  RM_NEED_REBOOT = 247,            /* done, a reboot activates it */
  RM_ERROR_NO_CORE_DUMP = 251,     /* made by this provider */
  RM_ERROR_VERSION_TOO_SMALL = 255 /* the size holds what is needed */
};

/* Sizes in bytes of the blocks that callers hand in. */
enum {
  RM_SERVER_ATTRIBUTES_SIZE = 784,
  RM_HBA_ATTRIBUTES_SIZE = 2864,
  RM_PORT_ATTRIBUTES_SIZE = 2048,
  RM_PORT_STATISTICS_SIZE = 512,
  RM_LUN_ATTRIBUTES_SIZE = 4096,
  RM_FEATURE_LIST_SIZE = 512,
  RM_VPD_SIZE = 1024,
  RM_VPD_V2_SIZE = 1536,
  RM_SFF_DATA_SIZE = 948,
  RM_EVENT_LOG_CONFIG_SIZE = 7220
};

/* Attribute numbers of a host (LRM_GetServerAttributes). */
enum { RM_SA_OS_INFO = 264 /* text: name and version of the operating system */ };

/* Attribute numbers of an adapter (LRM_GetHBAAttributes). "number" is four bytes. */
enum {
  RM_HA_NODE_SYMBOLIC_NAME = 0x207,   /* text */
  RM_HA_OPTION_ROM_VERSION = 0x209,   /* text */
  RM_HA_DEVICE_ID = 0x20E,            /* number */
  RM_HA_MODEL_ID = 0x20F,             /* number */
  RM_HA_OPERATIONAL_FIRMWARE = 0x210, /* text */
  RM_HA_SLI1_FIRMWARE_NAME = 0x211,   /* text */
  RM_HA_SLI2_FIRMWARE_NAME = 0x212,   /* text */
  RM_HA_IEEE_ADDRESS = 0x213,         /* six bytes */
  RM_HA_BOOT_CODE_ENABLED = 0x214,    /* number, or one byte; 0 is off */
  RM_HA_BOOT_BIOS_VERSION = 0x216,    /* text */
  RM_HA_DIAG_VERSION = 0x220,         /* number */
  RM_HA_INITIAL_FW_LOAD = 0x221,      /* text */
  RM_HA_KERNEL_VERSION = 0x222,       /* text */
  RM_HA_SLI3_FIRMWARE_NAME = 0x224,   /* text */
  RM_HA_SLI_MODE = 0x225,             /* number */
  RM_HA_BOARD_TEMPERATURE = 0x227,    /* number: bytes 0 now, 1 critical, 2 warning */
  RM_HA_PORT_NUMBER = 0x229,          /* number */
  RM_HA_PCI_BUS_NUMBER = 0x22B,       /* number */
  RM_HA_FUNCTION_TYPE = 0x22C,        /* number; 1, 2 and 3 are not FC functions */
  RM_HA_PCI_FUNCTION_NUMBER = 0x230,  /* number */
  RM_HA_SP_FIRMWARE_VERSION = 0x233,  /* text */
  RM_HA_SP_FIRMWARE_NAME = 0x234,     /* text */
  RM_HA_ULP_FIRMWARE_VERSION = 0x235, /* text */
  RM_HA_ULP_FIRMWARE_NAME = 0x236,    /* text */
  RM_HA_SUBADAPTER_ID = 0x24A,        /* text */
  RM_HA_FC_UNIVERSAL_VERSION = 0x24B, /* text */
  RM_HA_FC_X86_BIOS_VERSION = 0x24C,  /* text */
  RM_HA_FC_EFI_VERSION = 0x24D,       /* text */
  RM_HA_FC_FCODE_VERSION = 0x24E,     /* text */
  RM_HA_FIRMWARE_ON_FLASH = 0x24F     /* text */
};

/* Attribute numbers of a port (LRM_GetPortAttributes, LRM_SetAdapterAttribute). */
enum {
  RM_PA_PORT_TYPE = 0x305,   /* number, an HBA_PORTTYPE */
  RM_PA_PORT_STATE = 0x306,  /* number, an HBA_PORTSTATE or 20, 21, 22 */
  RM_PA_FABRIC_NAME = 0x30F, /* eight bytes, all zero without a fabric */
  RM_PA_FEC_STATE = 0x360    /* number */
};

/* Attribute numbers of the port statistics (LRM_GetPortStatistics); each value is eight bytes, all
 * ones when the hardware has no such counter. */
enum {
  RM_PS_FIRST = 0x401, /* read, and shown nowhere */
  RM_PS_EXCHANGES_ORIGINATED = 0x402,
  RM_PS_EXCHANGES_RESPONDED = 0x403,
  RM_PS_TX_SEQUENCES = 0x404,
  RM_PS_RX_SEQUENCES = 0x405,
  RM_PS_TX_FRAMES = 0x406,
  RM_PS_RX_FRAMES = 0x407,
  RM_PS_TX_WORDS = 0x408, /* in words of four bytes */
  RM_PS_RX_WORDS = 0x409, /* in words of four bytes */
  RM_PS_LIP_COUNT = 0x40C,
  RM_PS_NOS_COUNT = 0x40D,
  RM_PS_ERROR_FRAMES = 0x40E,
  RM_PS_DUMPED_FRAMES = 0x40F,
  RM_PS_LINK_FAILURES = 0x410,
  RM_PS_LOSS_OF_SYNC = 0x411,
  RM_PS_LOSS_OF_SIGNAL = 0x412,
  RM_PS_PRIMITIVE_SEQ_ERRORS = 0x413,
  RM_PS_INVALID_TX_WORDS = 0x414,
  RM_PS_CRC_ERRORS = 0x415,
  RM_PS_LINK_TRANSITIONS = 0x416,
  RM_PS_ACTIVE_RPIS = 0x417,
  RM_PS_ACTIVE_XRIS = 0x418,
  RM_PS_PRIMITIVE_SEQ_TIMEOUTS = 0x421,
  RM_PS_ELASTIC_OVERRUNS = 0x422,
  RM_PS_ARBITRATION_TIMEOUTS = 0x423
};

/* Attribute numbers of a logical unit (LRM_GetLunAttributes). */
enum {
  RM_LA_INQUIRY = 1537,       /* SCSI inquiry data */
  RM_LA_READ_CAPACITY = 1538, /* READ CAPACITY data, big-endian */
  RM_LA_DEVICE_NAME = 1539,   /* text, not always NUL-terminated */
  RM_LA_BLOCK_SIZE = 1540,    /* four bytes */
  RM_LA_LAST_LBA = 1541       /* eight bytes */
};

/* Feature numbers (LRM_GetHBAFeature). */
enum { RM_FEATURE_CORVAN_CNA = 201, RM_FEATURE_CORE_DUMP = 430 };

/* Boot code (LRM_SetBootBiosState), beacon (LRM_DiagBeacon) and diagnostic states. */
enum { RM_BOOT_DISABLE = 0, RM_BOOT_ENABLE = 1 };
enum { RM_BEACON_NOT_AVAILABLE = 1, RM_BEACON_OFF = 2, RM_BEACON_ON = 3 };
enum { RM_DIAG_QUEUED = 1, RM_DIAG_RUNNING = 2, RM_DIAG_CANCELED = 5, RM_DIAG_DONE = 6 };

/* List of logical units: count in and out, then `count` entries; 8 + 12 * count bytes. */
typedef struct RM_LunEntry {
  uint32_t lunLow; /* the 64-bit LUN, low half first */
  uint32_t lunHigh;
  uint8_t reserved[2];
  uint8_t osLunValid; /* 1: osLun holds the operating system's number */
  uint8_t osLun;
} RM_LunEntry;
typedef struct RM_LunList {
  uint32_t count;
  uint8_t reserved[4];
  RM_LunEntry entry[1];
} RM_LunList;

/* One driver parameter. The texts are NUL-terminated unless they fill their field. */
typedef struct RM_DriverParam {
  char name[32];
  uint32_t low;
  uint32_t high;
  uint32_t def; /* default, or the global value */
  uint32_t current;
  uint16_t exportFlag;
  uint16_t dynamic;
  char help[80];
} RM_DriverParam;

/* Optimized access storage list: count in and out, then `count` records of 36 bytes. */
typedef struct RM_OASLunEntry {
  char fcpLun[8];
  uint8_t lun;
  uint8_t reserved1[8];
  uint8_t state;
  uint8_t reserved2[18];
} RM_OASLunEntry;
typedef struct RM_OASLunList {
  uint32_t count;
  RM_OASLunEntry entry[1];
} RM_OASLunList;

/* Virtual ports of a physical port: count in and out, then `count` records of 24 bytes. */
typedef struct RM_VPortEntry {
  HBA_WWN wwpn;
  HBA_WWN wwnn;
  uint32_t fcId;
  uint8_t reserved[4];
} RM_VPortEntry;
typedef struct RM_VPortList {
  uint32_t count;
  RM_VPortEntry entry[1];
} RM_VPortList;

/* Attributes of one virtual port; the caller sets `version` to 3. */
typedef struct RM_VPortAttributes {
  uint8_t version;
  uint8_t reserved[19];
  char name[256];
  uint8_t rest[68];
} RM_VPortAttributes;

/* Names of dump files: capacity on the way in, count on the way out; 8 + 256 * count bytes. */
typedef struct RM_DumpFileNames {
  uint32_t count;
  uint8_t reserved[4];
  char name[1][256];
} RM_DumpFileNames;

/* Selects a local port by its index, for RM_GetLocalHBAInfo. */
typedef struct RM_LocalHBASelector {
  uint32_t reserved;
  uint32_t index;
} RM_LocalHBASelector;

/* What RM_GetLocalHBAInfo says of it; only the name is used. */
typedef struct RM_LocalHBAInfo {
  HBA_WWN wwpn;
  uint8_t rest[164];
} RM_LocalHBAInfo;

/* Outcome of a diagnostic. */
typedef struct RM_DiagResult {
  uint32_t reserved1;
  uint32_t state; /* RM_DIAG_... */
  uint32_t reserved2;
  uint32_t cyclesCompleted;
  uint32_t totalTime;
  uint32_t result; /* result code, 0 success */
  uint32_t reserved3;
  uint32_t errorCount;
  uint32_t reserved4[4];
} RM_DiagResult;

/* Contents of the flash: `count` is one more than the entries, of which there are at most 64. */
typedef struct RM_LoadListEntry {
  uint32_t next;
  uint32_t previous;
  uint32_t startAddress;
  uint32_t length;
  uint32_t programId[2];
  char description[24];
  uint32_t wakeup;
  char programType[24];
  char version[24];
} RM_LoadListEntry;
enum { RM_LOAD_LIST_MAX = 64 };
typedef struct RM_LoadList {
  uint32_t count;
  RM_LoadListEntry entry[RM_LOAD_LIST_MAX];
} RM_LoadList;

/* Extended event log configuration: the first word is the capacity, the fourth the count. */
typedef struct RM_EventLogConfig {
  uint32_t capacity;
  uint32_t reserved[2];
  uint32_t count;
  uint8_t rest[RM_EVENT_LOG_CONFIG_SIZE - 16];
} RM_EventLogConfig;

/* One module's event log setting. */
typedef struct RM_EventLogModule {
  uint32_t portMask;
  uint32_t functionMask;
  uint32_t value;
  char text1[50];
  char text2[50];
} RM_EventLogModule;

/* QoS tag table of the tagging library: a count, then records of 36 bytes. */
typedef struct CPQFC_QoSEntry {
  HBA_WWN source;
  HBA_WWN target;
  uint8_t reserved1[16];
  int8_t tag;
  uint8_t reserved2[3];
} CPQFC_QoSEntry;
typedef struct CPQFC_QoSTable {
  uint32_t numberOfEntries;
  CPQFC_QoSEntry entry[1];
} CPQFC_QoSTable;

/* ---- Core ---- */

RM_STATUS LRM_InitLib(void);
RM_STATUS LRM_ExitLib(void);
RM_STATUS LRM_SetDebugTraces(int level, int target);
/* Host attributes as seen through a target's name; size in and out. */
RM_STATUS LRM_GetServerAttributes(HBA_WWN name, void* block, uint32_t* size);
RM_STATUS LRM_GetHBAAttributes(HBA_WWN wwpn, void* block, uint32_t* size);
RM_STATUS LRM_GetPortAttributes(HBA_WWN wwpn, void* block, uint32_t* size);
RM_STATUS LRM_GetPortStatistics(HBA_WWN wwpn, void* block, uint32_t* size);
RM_STATUS LRM_GetDriverType(HBA_WWN wwpn, uint32_t* type);
RM_STATUS LRM_GetHBAFeature(HBA_WWN wwpn, uint32_t feature, uint32_t* value);
/* Fills `size` bytes, one flag for each feature number. */
RM_STATUS LRM_GetHBAFeatureList(HBA_WWN wwpn, uint32_t size, uint8_t* features);
RM_STATUS LRM_SetAdapterAttribute(HBA_WWN wwpn, uint32_t attribute, const void* value,
                                  uint32_t size);
/* `configStatus` 5: a reset activates the setting. */
RM_STATUS LRM_SetPortEnabled(HBA_WWN wwpn, uint8_t enable, uint8_t* configStatus);
RM_STATUS LRM_ResetHBA(HBA_WWN wwpn, int mode);
RM_STATUS LRM_SetBootBiosState(HBA_WWN wwpn, uint32_t state);
RM_STATUS LRM_GetQoS(HBA_WWN wwpn, void* info);

/* ---- Logical units and targets ---- */

RM_STATUS LRM_GetFcpTargetMapping(HBA_WWN wwpn, HBA_FCPTARGETMAPPING* mapping);
RM_STATUS LRM_GetLunList(HBA_WWN initiator, HBA_WWN target, uint32_t option, RM_LunList* list);
RM_STATUS LRM_GetLunAttributes(HBA_WWN initiator, HBA_WWN target, uint64_t lun, void* block,
                               uint32_t* size);
RM_STATUS LRM_ScsiInquiry(HBA_WWN initiator, HBA_WWN target, uint64_t lun, void* response,
                          uint32_t responseSize, void* sense, uint32_t senseSize);
RM_STATUS LRM_ScsiReadCapacity(HBA_WWN initiator, HBA_WWN target, uint64_t lun, void* response,
                               uint32_t responseSize, void* sense, uint32_t senseSize);
/* option 0 acts on the driver, 1 on the stored configuration. */
RM_STATUS LRM_SetOASLunState(HBA_WWN initiator, HBA_WWN port, HBA_WWN target, uint64_t lun,
                             uint8_t state, uint32_t option);
RM_STATUS LRM_GetOASLunList(HBA_WWN initiator, HBA_WWN port, HBA_WWN target, uint32_t option,
                            RM_OASLunList* list);

/* ---- Driver parameters; count in and out ---- */

RM_STATUS LRM_GetDriverParams(HBA_WWN wwpn, RM_DriverParam* params, uint32_t* count);
RM_STATUS LRM_GetDriverParamsGlobal(HBA_WWN wwpn, RM_DriverParam* params, uint32_t* count);
/* `text` is "name=value". */
RM_STATUS LRM_SetDriverParam(HBA_WWN wwpn, const char* text, uint32_t controlWord);

/* ---- World wide names ---- */

RM_STATUS LRM_ChangeWWN(HBA_WWN wwpn, HBA_WWN newWwpn, HBA_WWN newWwnn, uint32_t type,
                        uint32_t* operationStatus);
RM_STATUS LRM_RestoreWWN(HBA_WWN wwpn, uint32_t type, uint32_t* operationStatus);
RM_STATUS LRM_ReadWWN(HBA_WWN wwpn, uint32_t type, HBA_WWN* outWwpn, HBA_WWN* outWwnn,
                      uint32_t* operationStatus);
RM_STATUS LRM_GetWWNCapability(HBA_WWN wwpn, uint32_t* capability);

/* ---- Firmware, vital product data, transceiver ---- */

RM_STATUS LRM_DownloadFirmware(HBA_WWN wwpn, const char* path, int option);
RM_STATUS LRM_GetVPD(HBA_WWN wwpn, void* buffer, uint32_t* size);
RM_STATUS LRM_GetVPDV2(HBA_WWN wwpn, int kind, void* buffer, uint32_t* size);
RM_STATUS LRM_GetSffData(HBA_WWN wwpn, void* buffer, uint32_t* size);

/* ---- Virtual ports ---- */

RM_STATUS LRM_VPList(HBA_WWN wwpn, RM_VPortList* list);
RM_STATUS LRM_VPGetAttributes(HBA_WWN wwpn, HBA_WWN vport, RM_VPortAttributes* attributes);

/* ---- Dump ---- */

RM_STATUS LRM_GenerateDump(int option, HBA_WWN wwpn);
RM_STATUS LRM_GenerateEfdDump(HBA_WWN wwpn, int option, int flags);
RM_STATUS LRM_GenerateCoreDump(HBA_WWN wwpn, const char* options);
RM_STATUS LRM_GetDumpDirectoryA(HBA_WWN wwpn, char* directory, uint32_t size);
RM_STATUS LRM_SetDumpDirectory(HBA_WWN wwpn, const char* directory);
RM_STATUS LRM_GetDumpFileNames(HBA_WWN wwpn, RM_DumpFileNames* names);
RM_STATUS LRM_DeleteDumpFiles(HBA_WWN wwpn);
RM_STATUS LRM_GetDumpRetentionCount(HBA_WWN wwpn, uint32_t* count);
RM_STATUS LRM_SetDumpRetentionCount(HBA_WWN wwpn, uint32_t count);
RM_STATUS LRM_RetrieveFATDump(HBA_WWN wwpn);
RM_STATUS LRM_RetrieveFATDump2(HBA_WWN wwpn);
RM_STATUS LRM_Get_BE_EventLogConfigDataAll(HBA_WWN wwpn, RM_EventLogConfig* config);
RM_STATUS LRM_Set_BE_EventLogConfigDataModule(HBA_WWN wwpn, const RM_EventLogModule* module);
RM_STATUS LRM_Set_BE_EventLogTraceLevel(HBA_WWN wwpn, uint32_t a, uint32_t b, uint32_t c,
                                        uint32_t d);
RM_STATUS LRM_Set_BE_DefaultLoggingConfig(HBA_WWN wwpn);

/* ---- Diagnostics; a running test is named by its port and the id that its start gave ---- */

RM_STATUS LRM_DiagBeacon(HBA_WWN wwpn, uint32_t state);
RM_STATUS LRM_DiagBeaconState(HBA_WWN wwpn, uint32_t* state);
RM_STATUS LRM_DiagCancelDiagnostic(HBA_WWN wwpn, uint32_t id);
RM_STATUS LRM_DiagGetResults(HBA_WWN wwpn, uint32_t id, RM_DiagResult* result);
RM_STATUS LRM_DiagRunPOST(HBA_WWN wwpn, uint32_t* id);
/* `pattern` is text of hexadecimal digits. */
RM_STATUS LRM_DiagEchoTestV2(HBA_WWN wwpn, HBA_WWN target, uint32_t cycles, uint32_t haltOnError,
                             uint32_t* id, uint32_t option, const char* pattern);
/* `kind` 0 external, 1 internal. */
RM_STATUS LRM_DiagLoopBackTestV3(HBA_WWN wwpn, uint32_t kind, uint32_t cycles, uint32_t haltOnError,
                                 uint32_t* id, uint32_t option, const char* pattern);
RM_STATUS LRM_DiagPciLoopBackTestV2(HBA_WWN wwpn, uint32_t cycles, uint32_t haltOnError,
                                    uint32_t* id, uint32_t option, const char* pattern);
RM_STATUS LRM_DiagGetLoadListParams(HBA_WWN wwpn, RM_LoadList* list);
/* Configuration registers of the port's function; size in and out. */
RM_STATUS LRM_DiagReadPCIRegistersV2(HBA_WWN wwpn, RM_PCIRegisters* registers, uint32_t* size);

/* ---- Entry points without the longer name ---- */

/* The value of one attribute in a block, or null. `length` takes its size in bytes; `status` is 0
 * when the value is there. */
void* RM_GetAttributeValue(const void* block, uint32_t attribute, uint32_t* length,
                           RM_STATUS* status);
uint32_t RM_GetNumberOfLocalAdapters(void);
RM_STATUS RM_GetLocalHBAInfo(const RM_LocalHBASelector* selector, RM_LocalHBAInfo* info);
/* Reads the entry at `cursor` (the VPD buffer at first) and gives the next cursor, null at the end.
 * The texts are NUL-terminated; sizes in bytes, NUL included. */
void* RM_GetNextVpdEntry(const void* cursor, char* keyword, uint32_t keywordSize, char* value,
                         uint32_t valueSize);
RM_STATUS RM_GetVersion(int selector, char* text, uint32_t* size);
RM_STATUS RM_MiliVersion(char* text, uint32_t size);
RM_STATUS RM_StatusString(RM_STATUS status, char* text, uint32_t size);
RM_STATUS RM_IsLocalHBA(HBA_WWN wwpn, uint32_t* local);
RM_STATUS RM_ValidateWwn(HBA_WWN wwn);
RM_STATUS RM_ImportHBAFileA(const char* path);
RM_STATUS RM_VerifyFirmwareA(int option, HBA_WWN wwpn, const char* path);

/* ---- Frame tagging library ---- */

uint32_t CPQFC_GetNumberOfAdapters(void);
HBA_HANDLE CPQFC_OpenAdapter(const char* adapterName);
void CPQFC_CloseAdapter(HBA_HANDLE handle);
int CPQFC_LoadLibrary(void);
int CPQFC_FreeLibrary(void);
int CPQFC_QoSGetGlobalFlag(HBA_HANDLE handle, uint32_t* value);
int CPQFC_QoSSetGlobalFlag(HBA_HANDLE handle, uint32_t value);
/* With a count of 0 in the table, reports the count needed. */
int CPQFC_QoSGetConfig(HBA_HANDLE handle, CPQFC_QoSTable* table);
int CPQFC_QoSSetConfig(HBA_HANDLE handle, CPQFC_QoSTable* table);

#ifdef __cplusplus
}
#endif

#endif
