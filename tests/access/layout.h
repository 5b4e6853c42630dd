// Sizes and offsets of the SNIA records, taken from whichever header was included before.
#pragma once

#include <cstddef>
#include <string>
#include <vector>

namespace tvx::test {

struct Layout {
  std::string what;
  std::size_t value;
  bool operator==(const Layout&) const = default;
};

std::vector<Layout> publishedLayouts();

}  // namespace tvx::test

// Macros: one list has to be compiled against two headers.
#define TVX_SIZE(TYPE)  \
  Layout {              \
#TYPE, sizeof(TYPE) \
  }
#define TVX_AT(TYPE, FIELD)                 \
  Layout {                                  \
#TYPE "." #FIELD, offsetof(TYPE, FIELD) \
  }
#define TVX_VALUE(NAME)                     \
  Layout {                                  \
#NAME, static_cast < std::size_t>(NAME) \
  }

#define TVX_SNIA_LAYOUTS                                                                        \
  TVX_SIZE(HBA_UINT8), TVX_SIZE(HBA_UINT16), TVX_SIZE(HBA_UINT32), TVX_SIZE(HBA_UINT64),        \
      TVX_SIZE(HBA_HANDLE), TVX_SIZE(HBA_STATUS), TVX_SIZE(HBA_WWN), TVX_SIZE(HBA_FC4TYPES),    \
      TVX_SIZE(HBA_CALLBACKHANDLE), TVX_SIZE(HBA_ADAPTERATTRIBUTES),                            \
      TVX_AT(HBA_ADAPTERATTRIBUTES, Manufacturer), TVX_AT(HBA_ADAPTERATTRIBUTES, SerialNumber), \
      TVX_AT(HBA_ADAPTERATTRIBUTES, Model), TVX_AT(HBA_ADAPTERATTRIBUTES, ModelDescription),    \
      TVX_AT(HBA_ADAPTERATTRIBUTES, NodeWWN), TVX_AT(HBA_ADAPTERATTRIBUTES, NodeSymbolicName),  \
      TVX_AT(HBA_ADAPTERATTRIBUTES, HardwareVersion),                                           \
      TVX_AT(HBA_ADAPTERATTRIBUTES, DriverVersion),                                             \
      TVX_AT(HBA_ADAPTERATTRIBUTES, OptionROMVersion),                                          \
      TVX_AT(HBA_ADAPTERATTRIBUTES, FirmwareVersion),                                           \
      TVX_AT(HBA_ADAPTERATTRIBUTES, VendorSpecificID),                                          \
      TVX_AT(HBA_ADAPTERATTRIBUTES, NumberOfPorts), TVX_AT(HBA_ADAPTERATTRIBUTES, DriverName),  \
      TVX_SIZE(HBA_PORTATTRIBUTES), TVX_AT(HBA_PORTATTRIBUTES, NodeWWN),                        \
      TVX_AT(HBA_PORTATTRIBUTES, PortWWN), TVX_AT(HBA_PORTATTRIBUTES, PortFcId),                \
      TVX_AT(HBA_PORTATTRIBUTES, PortType), TVX_AT(HBA_PORTATTRIBUTES, PortState),              \
      TVX_AT(HBA_PORTATTRIBUTES, PortSupportedClassofService),                                  \
      TVX_AT(HBA_PORTATTRIBUTES, PortSupportedFc4Types),                                        \
      TVX_AT(HBA_PORTATTRIBUTES, PortActiveFc4Types),                                           \
      TVX_AT(HBA_PORTATTRIBUTES, PortSymbolicName), TVX_AT(HBA_PORTATTRIBUTES, OSDeviceName),   \
      TVX_AT(HBA_PORTATTRIBUTES, PortSupportedSpeed), TVX_AT(HBA_PORTATTRIBUTES, PortSpeed),    \
      TVX_AT(HBA_PORTATTRIBUTES, PortMaxFrameSize), TVX_AT(HBA_PORTATTRIBUTES, FabricName),     \
      TVX_AT(HBA_PORTATTRIBUTES, NumberofDiscoveredPorts), TVX_SIZE(HBA_SCSIID),                \
      TVX_AT(HBA_SCSIID, OSDeviceName), TVX_AT(HBA_SCSIID, ScsiBusNumber),                      \
      TVX_AT(HBA_SCSIID, ScsiTargetNumber), TVX_AT(HBA_SCSIID, ScsiOSLun), TVX_SIZE(HBA_FCPID), \
      TVX_AT(HBA_FCPID, FcId), TVX_AT(HBA_FCPID, NodeWWN), TVX_AT(HBA_FCPID, PortWWN),          \
      TVX_AT(HBA_FCPID, FcpLun), TVX_SIZE(HBA_FCPSCSIENTRY), TVX_AT(HBA_FCPSCSIENTRY, ScsiId),  \
      TVX_AT(HBA_FCPSCSIENTRY, FcpId), TVX_SIZE(HBA_FCPTARGETMAPPING),                          \
      TVX_AT(HBA_FCPTARGETMAPPING, NumberOfEntries), TVX_AT(HBA_FCPTARGETMAPPING, entry),       \
      TVX_VALUE(HBA_STATUS_OK), TVX_VALUE(HBA_STATUS_ERROR),                                    \
      TVX_VALUE(HBA_STATUS_ERROR_NOT_SUPPORTED), TVX_VALUE(HBA_STATUS_ERROR_INVALID_HANDLE),    \
      TVX_VALUE(HBA_STATUS_ERROR_ARG), TVX_VALUE(HBA_STATUS_ERROR_ILLEGAL_WWN),                 \
      TVX_VALUE(HBA_STATUS_ERROR_ILLEGAL_INDEX), TVX_VALUE(HBA_STATUS_ERROR_MORE_DATA),         \
      TVX_VALUE(HBA_STATUS_ERROR_STALE_DATA), TVX_VALUE(HBA_STATUS_SCSI_CHECK_CONDITION),       \
      TVX_VALUE(HBA_STATUS_ERROR_BUSY), TVX_VALUE(HBA_STATUS_ERROR_TRY_AGAIN),                  \
      TVX_VALUE(HBA_STATUS_ERROR_UNAVAILABLE), TVX_VALUE(HBA_PORTTYPE_UNKNOWN),                 \
      TVX_VALUE(HBA_PORTTYPE_OTHER), TVX_VALUE(HBA_PORTTYPE_NOTPRESENT),                        \
      TVX_VALUE(HBA_PORTTYPE_NPORT), TVX_VALUE(HBA_PORTTYPE_NLPORT),                            \
      TVX_VALUE(HBA_PORTTYPE_FLPORT), TVX_VALUE(HBA_PORTTYPE_FPORT),                            \
      TVX_VALUE(HBA_PORTTYPE_LPORT), TVX_VALUE(HBA_PORTTYPE_PTP),                               \
      TVX_VALUE(HBA_PORTSTATE_UNKNOWN), TVX_VALUE(HBA_PORTSTATE_ONLINE),                        \
      TVX_VALUE(HBA_PORTSTATE_OFFLINE), TVX_VALUE(HBA_PORTSTATE_BYPASSED),                      \
      TVX_VALUE(HBA_PORTSTATE_DIAGNOSTICS), TVX_VALUE(HBA_PORTSTATE_LINKDOWN),                  \
      TVX_VALUE(HBA_PORTSTATE_ERROR), TVX_VALUE(HBA_PORTSTATE_LOOPBACK),                        \
      TVX_VALUE(HBA_PORTSPEED_UNKNOWN), TVX_VALUE(HBA_PORTSPEED_1GBIT),                         \
      TVX_VALUE(HBA_PORTSPEED_2GBIT), TVX_VALUE(HBA_PORTSPEED_10GBIT)
