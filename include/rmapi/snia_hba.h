/* The part of the SNIA HBA API (version 2) that this project calls: types, status values and the
 * prototypes of its C functions, written from the published API.
 *
 * Conventions of the API:
 *  - every multi-byte integer is in host order; names are eight bytes, most significant first;
 *  - fixed text fields are NUL-terminated by well-behaved libraries, which a caller must not rely
 * on;
 *  - a handle is valid from HBA_OpenAdapter to HBA_CloseAdapter and is never 0.
 * Layouts equal those of the published header; a test compares the two. Do not include both in one
 * translation unit. */
#ifndef RMAPI_SNIA_HBA_H
#define RMAPI_SNIA_HBA_H

#ifdef __cplusplus
extern "C" {
#endif

typedef unsigned char HBA_UINT8;
typedef char HBA_INT8;
typedef unsigned short HBA_UINT16;
typedef short HBA_INT16;
typedef unsigned int HBA_UINT32;
typedef int HBA_INT32;
typedef HBA_UINT32 HBA_VOID32;
typedef long long HBA_INT64;
typedef long long HBA_UINT64; /* signed in the published header too */

/* An open adapter; 0 is no handle. */
typedef HBA_UINT32 HBA_HANDLE;

/* Result of most calls. */
typedef HBA_UINT32 HBA_STATUS;
#define HBA_STATUS_OK 0
#define HBA_STATUS_ERROR 1
#define HBA_STATUS_ERROR_NOT_SUPPORTED 2
#define HBA_STATUS_ERROR_INVALID_HANDLE 3
#define HBA_STATUS_ERROR_ARG 4
#define HBA_STATUS_ERROR_ILLEGAL_WWN 5
#define HBA_STATUS_ERROR_ILLEGAL_INDEX 6
#define HBA_STATUS_ERROR_MORE_DATA 7  /* the buffer is too small; the count says what is needed */
#define HBA_STATUS_ERROR_STALE_DATA 8 /* HBA_RefreshInformation is needed first */
#define HBA_STATUS_SCSI_CHECK_CONDITION 9
#define HBA_STATUS_ERROR_BUSY 10
#define HBA_STATUS_ERROR_TRY_AGAIN 11
#define HBA_STATUS_ERROR_UNAVAILABLE 12

typedef HBA_UINT32 HBA_PORTTYPE;
#define HBA_PORTTYPE_UNKNOWN 1
#define HBA_PORTTYPE_OTHER 2
#define HBA_PORTTYPE_NOTPRESENT 3
#define HBA_PORTTYPE_NPORT 5
#define HBA_PORTTYPE_NLPORT 6
#define HBA_PORTTYPE_FLPORT 7
#define HBA_PORTTYPE_FPORT 8
#define HBA_PORTTYPE_LPORT 20
#define HBA_PORTTYPE_PTP 21

typedef HBA_UINT32 HBA_PORTSTATE;
#define HBA_PORTSTATE_UNKNOWN 1
#define HBA_PORTSTATE_ONLINE 2
#define HBA_PORTSTATE_OFFLINE 3
#define HBA_PORTSTATE_BYPASSED 4
#define HBA_PORTSTATE_DIAGNOSTICS 5
#define HBA_PORTSTATE_LINKDOWN 6
#define HBA_PORTSTATE_ERROR 7
#define HBA_PORTSTATE_LOOPBACK 8

/* Bit mask of speeds. */
typedef HBA_UINT32 HBA_PORTSPEED;
#define HBA_PORTSPEED_UNKNOWN 0
#define HBA_PORTSPEED_1GBIT 1
#define HBA_PORTSPEED_2GBIT 2
#define HBA_PORTSPEED_10GBIT 4

/* Bit mask of FC classes of service. */
typedef HBA_UINT32 HBA_COS;

/* 256 bits, one for each FC-4 type. */
typedef struct HBA_fc4types {
  HBA_UINT8 bits[32];
} HBA_FC4TYPES, *PHBA_FC4TYPES;

/* World wide name of a port, node or fabric, most significant byte first; passed by value. */
typedef struct HBA_wwn {
  HBA_UINT8 wwn[8];
} HBA_WWN, *PHBA_WWN;

typedef struct hba_AdapterAttributes {
  char Manufacturer[64];
  char SerialNumber[64];
  char Model[256];
  char ModelDescription[256];
  HBA_WWN NodeWWN;
  char NodeSymbolicName[256];
  char HardwareVersion[256];
  char DriverVersion[256];
  char OptionROMVersion[256];
  char FirmwareVersion[256];
  HBA_UINT32 VendorSpecificID;
  HBA_UINT32 NumberOfPorts;
  char DriverName[256];
} HBA_ADAPTERATTRIBUTES, *PHBA_ADAPTERATTRIBUTES;

typedef struct HBA_PortAttributes {
  HBA_WWN NodeWWN;
  HBA_WWN PortWWN;
  HBA_UINT32 PortFcId;
  HBA_PORTTYPE PortType;
  HBA_PORTSTATE PortState;
  HBA_COS PortSupportedClassofService;
  HBA_FC4TYPES PortSupportedFc4Types;
  HBA_FC4TYPES PortActiveFc4Types;
  char PortSymbolicName[256];
  char OSDeviceName[256];
  HBA_PORTSPEED PortSupportedSpeed;
  HBA_PORTSPEED PortSpeed;
  HBA_UINT32 PortMaxFrameSize;
  HBA_WWN FabricName;
  HBA_UINT32 NumberofDiscoveredPorts;
} HBA_PORTATTRIBUTES, *PHBA_PORTATTRIBUTES;

/* How the operating system addresses one logical unit. */
typedef struct HBA_ScsiId {
  char OSDeviceName[256];
  HBA_UINT32 ScsiBusNumber;
  HBA_UINT32 ScsiTargetNumber;
  HBA_UINT32 ScsiOSLun;
} HBA_SCSIID, *PHBA_SCSIID;

/* How the fabric addresses it; FcpLun holds the eight SCSI LUN bytes in memory order. */
typedef struct HBA_FcpId {
  HBA_UINT32 FcId;
  HBA_WWN NodeWWN;
  HBA_WWN PortWWN;
  HBA_UINT64 FcpLun;
} HBA_FCPID, *PHBA_FCPID;

typedef struct HBA_FcpScsiEntry {
  HBA_SCSIID ScsiId;
  HBA_FCPID FcpId;
} HBA_FCPSCSIENTRY, *PHBA_FCPSCSIENTRY;

/* NumberOfEntries holds the room on the way in, and the entries found (or needed) on the way out.
 * The rows start 8 bytes into the record. */
typedef struct HBA_FCPTargetMapping {
  HBA_UINT32 NumberOfEntries;
  HBA_FCPSCSIENTRY entry[1];
} HBA_FCPTARGETMAPPING, *PHBA_FCPTARGETMAPPING;

typedef void* HBA_CALLBACKHANDLE;
typedef void (*HBA_PORT_EVENT_CALLBACK)(void* data, HBA_WWN portWWN, HBA_UINT32 eventType,
                                        HBA_UINT32 fabricPortID);

/* Loads the vendor libraries (common library) or prepares the library itself. */
HBA_STATUS HBA_LoadLibrary(void);
HBA_STATUS HBA_FreeLibrary(void);
/* Number of adapters; 0 also when anything fails. */
HBA_UINT32 HBA_GetNumberOfAdapters(void);
/* Writes the NUL-terminated name of the adapter, at most 256 bytes. */
HBA_STATUS HBA_GetAdapterName(HBA_UINT32 adapterIndex, char* adapterName);
HBA_HANDLE HBA_OpenAdapter(char* adapterName);
void HBA_CloseAdapter(HBA_HANDLE handle);
HBA_STATUS HBA_GetAdapterAttributes(HBA_HANDLE handle, HBA_ADAPTERATTRIBUTES* attributes);
HBA_STATUS HBA_GetAdapterPortAttributes(HBA_HANDLE handle, HBA_UINT32 portIndex,
                                        HBA_PORTATTRIBUTES* attributes);
/* Drops the library's cached view of the adapter, after HBA_STATUS_ERROR_STALE_DATA. */
void HBA_RefreshInformation(HBA_HANDLE handle);
HBA_STATUS HBA_GetFcpTargetMapping(HBA_HANDLE handle, HBA_FCPTARGETMAPPING* mapping);
/* evpd 0 asks for the standard inquiry data, 1 for the given page. Sizes are in bytes. */
HBA_STATUS HBA_SendScsiInquiry(HBA_HANDLE handle, HBA_WWN portWWN, HBA_UINT64 fcLUN, HBA_UINT8 evpd,
                               HBA_UINT32 pageCode, void* response, HBA_UINT32 responseSize,
                               void* sense, HBA_UINT32 senseSize);
HBA_STATUS HBA_SendReadCapacity(HBA_HANDLE handle, HBA_WWN portWWN, HBA_UINT64 fcLUN,
                                void* response, HBA_UINT32 responseSize, void* sense,
                                HBA_UINT32 senseSize);
HBA_STATUS HBA_RegisterForAdapterPortEvents(HBA_PORT_EVENT_CALLBACK callback, void* userData,
                                            HBA_HANDLE handle, HBA_WWN portWWN,
                                            HBA_CALLBACKHANDLE* callbackHandle);
HBA_STATUS HBA_RemoveCallback(HBA_CALLBACKHANDLE callbackHandle);

#ifdef __cplusplus
}
#endif

#endif
