// The layer between the class providers and the adapter management library.
#pragma once

#include <cstdint>
#include <string>

#include "access/TVX_Runtime_Loader.h"
#include "common/TVX_Memory.h"
#include "runtime/Instance.h"

namespace cimrt {

/// What `tvxcimGetTargetMapping` finds out about one logical unit. Zero where it is not known.
struct ExtendedLunInfo {
  std::uint64_t BlockSize = 0;   ///< bytes
  std::int32_t MaxLba = 0;       ///< low 32 bits of the last logical block address
  std::uint64_t TotalBytes = 0;  ///< block size times the full last address
  char DeviceName[256] = {};     ///< the last character is always NUL
  std::uint8_t OsLunByte = 0;    ///< 0, or the operating system's number with bit 7 set
};

/// Bytes of a library version.
inline constexpr std::size_t TVX_VERSION_SIZE = 64;
/// Bytes of a target's operating system text.
inline constexpr std::size_t TVX_OS_INFO_SIZE = 40;

/// Length of an HBA name text: eight pairs of digits and seven colons, without the NUL.
inline constexpr std::size_t TVX_HBA_NAME_LENGTH = 23;

/// Bytes of a dump directory.
inline constexpr std::size_t TVX_DUMP_DIRECTORY_SIZE = 256;
/// How many dump files can be kept.
inline constexpr std::uint32_t TVX_LEAST_RETENTION = 1;
inline constexpr std::uint32_t TVX_MOST_RETENTION = 20;
/// The option of `tvxcimDumpDiagnostic` that asks for a whole dump.
inline constexpr int TVX_WHOLE_DUMP = -1;

/// What a port's location indicator can say.
inline constexpr std::uint16_t TVX_INDICATOR_UNKNOWN = 0;
inline constexpr std::uint16_t TVX_INDICATOR_ON = 2;
inline constexpr std::uint16_t TVX_INDICATOR_OFF = 3;
inline constexpr std::uint16_t TVX_INDICATOR_NOT_SUPPORTED = 4;
/// Answer of the two beacon operations to an argument that they can't work with.
inline constexpr int TVX_BEACON_REFUSED = 0x80C8;

/// Whose parameters: those of one port, or those of the driver as a whole.
enum class TVX_Driver_Scope { LOCAL, GLOBAL };

/// Parameters as the library lists them. Their texts need not be terminated.
struct TVX_Driver_Params {
  TVX_Block block;          ///< `count` records of `RM_DriverParam`
  std::uint32_t count = 0;  ///< never more than the block holds
  std::uint32_t room = 0;   ///< records that the block holds
  const RM_DriverParam& operator[](std::uint32_t i) const {
    return reinterpret_cast<const RM_DriverParam*>(block.get())[i];
  }
};

/// Turns text names into `HBA_WWN`s, checks that a port is local, calls one entry point, prints its
/// status and hands it back. All operations but the constructor are static, never throw, take no
/// lock and return an `RM_STATUS` unless told. They work between `LoadRuntimeLibraries` and
/// `UnloadRuntimeLibraries`; without libraries they take their failure paths.
///
/// `wwpn` always points to the name of a port. Name texts: "device id" is 16 hexadecimal digits,
/// "HBA name" is 23 characters, pairs of digits with colons between.
class TVX_MethodWrapper {
 public:
  /// Initialises the management library under two semaphores named after the process. Throws
  /// `std::exception` if the library refuses.
  TVX_MethodWrapper();
  /// Drops the first semaphore. The library stays initialised.
  ~TVX_MethodWrapper();
  TVX_MethodWrapper(const TVX_MethodWrapper&) = delete;
  TVX_MethodWrapper& operator=(const TVX_MethodWrapper&) = delete;

  /// Device id to HBA name. One leading double quote is passed over; no character is checked. A
  /// text that ends early gives a shortened name, which `str2HBAName` refuses.
  /// @param hbaName at least 24 bytes
  /// @return 0, or 1 if a pointer is null
  static RM_STATUS Id2HBAName(char* hbaName, const char* deviceId);
  /// HBA name to WWN. Blanks may stand for the colons. 0, or 1 if the text is refused.
  static RM_STATUS str2HBAName(HBA_WWN* wwn, const char* hbaName);
  /// 16 digits to WWN. Mind the sense: 1 on success, 0 on failure.
  static int string2HBAName(HBA_WWN* wwn, const char* text);
  /// WWN to HBA name, upper-case, NUL-terminated. A null output is ignored. Always 0.
  static RM_STATUS HBAName2str(char* hbaName, const HBA_WWN& wwn);

  /// Both conversions of a device id in one step. 0, or 1 with "Id2HBAName failed" or "str2HBAName
  /// failed" logged at `TVX_ERR`.
  static RM_STATUS deviceIdToWWN(HBA_WWN* wwn, const char* deviceId);

  /// 0 if the port is local, 1 if not.
  static RM_STATUS Validatewwpn(const HBA_WWN* wwpn);
  /// 1 if the port belongs to a converged adapter of that kind, else 0.
  static int IsCorvanCNA(const HBA_WWN* wwpn);
  /// Logs a status with the library's text for it.
  static void StatusString(RM_STATUS status);

  /// @param version 64 bytes
  static RM_STATUS GetMILILibVersion(char* version);
  /// @param room bytes that `version` holds; a longer version is cut
  static RM_STATUS GetLibraryVersion(int selector, char* version,
                                     std::size_t room = TVX_VERSION_SIZE);
  static RM_STATUS SetMILITraceLevel(int level, int target);
  /// @param features 512 bytes
  static RM_STATUS GetHBAFeatureList(const HBA_WWN* wwpn, std::uint8_t* features);
  static RM_STATUS GetQosInfo(const HBA_WWN* wwpn, void* info);

  /// Size, device name and system number of one logical unit. 0 whatever the devices answer, 1 if a
  /// name can't be converted or memory runs out.
  static RM_STATUS tvxcimGetTargetMapping(const char* initiatorId, const char* targetId,
                                          std::uint64_t lun, ExtendedLunInfo* info);
  /// The operating system of the host behind a name.
  /// @param osInfo 40 bytes; NUL-terminated only if the text is shorter than that
  static RM_STATUS getTargetOS_info(const char* name, char* osInfo);

  /// The virtual ports of a local port. The status, or RM_ERROR with the reason logged.
  /// @param list takes an `RM_VPortList` whose count never exceeds what it holds; the caller owns
  /// it
  static RM_STATUS ListVPorts(const HBA_WWN* wwpn, TVX_Block* list);
  /// What the library says of one of them.
  /// @param attributes takes an `RM_VPortAttributes`, whose texts need not be terminated; the
  /// caller owns it
  static RM_STATUS ListVPortAttributes(const HBA_WWN* wwpn, const HBA_WWN& vport,
                                       TVX_Block* attributes);

  /// The beacon of a port as its location indicator; left as it was while the port can't tell.
  /// @return 0, also when the library fails; TVX_BEACON_REFUSED for arguments that are no good
  static int GetBeaconState(const char* deviceId, std::uint16_t* indicator);
  /// Turns the beacon on or off.
  /// @param indicator TVX_INDICATOR_ON or TVX_INDICATOR_OFF
  /// @return 0, also when the library fails, which is only logged; TVX_BEACON_REFUSED for any
  /// other indicator
  static int SetBeaconState(const HBA_WWN& wwpn, std::uint16_t indicator);

  /// Room for as many parameters as a driver has as a rule. RM_ERROR_NO_MEMORY is logged.
  static RM_STATUS AllocateDriverParams(TVX_Driver_Params* params);
  /// The parameters of the driver, for one port or for all, asked for through a port. Status 7 or
  /// 191 has the list read once more with the room that it needs. The status, or
  /// RM_ERROR_NO_MEMORY; each failure is logged.
  /// @param params its block is used again, and is made if there is none; without meaning on
  /// failure
  static RM_STATUS ReadDriverParams(const HBA_WWN& wwpn, TVX_Driver_Scope scope,
                                    TVX_Driver_Params* params);
  /// Sets one parameter.
  /// @param deviceId name of the port, for the log alone
  /// @param cw1 1: the driver's parameter, 0: the port's
  /// @param cw2 1: the change outlives a reboot, 0: until then
  /// @return the library's status; 1 for a port that is not local, or wrong arguments
  static RM_STATUS tvxcimSetDriverParam(const char* deviceId, const HBA_WWN* wwpn,
                                        std::uint32_t cw1, std::uint32_t cw2, const char* parameter,
                                        const char* value);

  /// Marks a unit for optimized access, or takes the mark away.
  /// @param initiator, port, target device ids; without virtual ports the first two are the same
  /// @param lunText the unit's number in decimal
  /// @param state 1 or 0
  /// @param option 0: in the driver, 1: in the stored configuration
  static RM_STATUS SetOASLunState(const char* initiator, const char* port, const char* target,
                                  const char* lunText, std::uint8_t state, std::uint32_t option);
  /// The units that are marked behind a target; arguments as above. The status, RM_ERROR_NO_MEMORY,
  /// or 1 for names that can't be converted.
  /// @param list takes an `RM_OASLunList` whose count never exceeds what it holds; the caller owns
  /// it; left as it was on failure
  static RM_STATUS GetOASLunList(const char* initiator, const char* port, const char* target,
                                 std::uint32_t option, TVX_Block* list);

  /// Turns a URI into the path of a local file. A path or file URI whose file is there is answered
  /// as its path; anything else is fetched with libcurl into the working directory, under the name
  /// behind the last "/" of the URI. Certificates are not checked.
  /// @param status set to a code when something failed, a libcurl code or 4 for a libcurl without
  /// a function; left as it was otherwise, also when there is no libcurl: then there is no file
  /// @param fetched set to true once a transfer was begun, also one that failed: the file at the
  /// path is then a temporary one that the caller removes. Left as it was otherwise
  /// @return the path of the file; the URI itself, or what its file would be called, on failure
  static String downloadFileUsingCurl(const String& URI, Property<std::uint32_t>& status,
                                      bool& fetched);
  /// Sends a local file to a URI with libcurl, without checking certificates.
  /// @return 0; 1 if the file can't be opened; -1 for any other failure
  static int uploadFileUsingCurl(const String& URI, const char* localPath);

  /// Has the library import, verify and flash a firmware file. Minutes may pass.
  /// @return 0, 247 when the firmware waits for a reboot, another status of the library, or 1 for a
  /// port that is not local or a file that is not there
  static RM_STATUS tvxcimDownloadFW(const HBA_WWN* wwpn, const char* path);
  /// Reads the version of the firmware on flash again and puts it into `FirmwareOnFlash` of the
  /// port's software identity, if the agent has one. The caller holds the agent's data lock.
  static RM_STATUS UpdateFirmwareOnFlash(const HBA_WWN* wwpn);
  /// Resets the adapter of a port.
  static RM_STATUS tvxcimReset(const HBA_WWN* wwpn);
  /// Switches forward error correction of a port.
  static RM_STATUS SetFECState(const char* deviceId, bool enable);
  /// Enables or disables a port.
  /// @param configStatus what the library says to it, 5 when a reset is needed; left as it was on
  /// failure
  static RM_STATUS SetPortEnabled(const char* deviceId, bool enable, std::uint8_t* configStatus);

  // World wide names. `status` takes the result of a method: 0, or the library's status plus 40000.
  // `operationStatus` takes what the library tells beside its status; where no rule gives it a
  // value it keeps the one that it has. After a change or a restore the caller owes a refresh.

  /// Gives a port new names, unless a virtual port of this host has one of them: that gives 91 and
  /// leaves the library alone. Waits for a busy adapter, up to about five minutes.
  /// @param type 0 volatile, 1 non-volatile
  static void ChangeWWN(const HBA_WWN& wwpn, const HBA_WWN& newWwpn, const HBA_WWN& newWwnn,
                        std::uint16_t type, Property<std::uint16_t>& operationStatus,
                        Property<std::uint32_t>& status);
  /// Puts names back, waiting as `ChangeWWN` does. `status` is 0 after a failure, too.
  /// @param type 0 factory default, 1 non-volatile
  static void RestoreWWN(const HBA_WWN& wwpn, std::uint16_t type,
                         Property<std::uint16_t>& operationStatus, Property<std::uint32_t>& status);
  /// The names of one kind, in lower case with colons; left as they were without a result of 0, and
  /// where there are no configured names.
  /// @param type 0 volatile, 1 non-volatile, 2 factory default, 3 current, 4 configured
  static void ReadWWN(const HBA_WWN& wwpn, std::uint16_t type, Property<String>& wwpnOut,
                      Property<String>& wwnnOut, Property<std::uint16_t>& operationStatus,
                      Property<std::uint32_t>& status);
  /// What may be done with the names of a port, as a set of bits.
  /// @param capability left as it was on failure
  static void GetWWNCapability(const HBA_WWN& wwpn, Property<std::uint32_t>& capability,
                               Property<std::uint32_t>& status);

  /// Turns the boot code of a port on or off. The port need not be local.
  /// @param controlWord one character: 'e' or 'E' turns it on, 'd' or 'D' off
  /// @return the library's status; 1 for any other character, without asking the library
  static RM_STATUS tvxcimSetBootBiosState(const HBA_WWN& wwpn, const char* controlWord);
  /// The state of the boot code, as the library's byte for it.
  /// @param state left as it was on failure
  /// @return 0, or 1 with the reason logged
  static RM_STATUS tvxcimGetBootBiosState(const HBA_WWN& wwpn, std::uint32_t* state);

  /// Has the library write a dump of a port.
  /// @param option TVX_WHOLE_DUMP, or the number of an extended dump
  static RM_STATUS tvxcimDumpDiagnostic(const HBA_WWN& wwpn, int option);
  /// Removes the dump files of a local port.
  static RM_STATUS tvxcimDeleteDumpFiles(const HBA_WWN& wwpn);
  /// The names of the dump files of a local port.
  /// @param list its count says how many names it holds; takes how many there are
  /// @return RM_ERROR_LIST_TOO_SMALL if there are more; RM_ERROR_INVALID_POINTER without a list
  static RM_STATUS GetDumpFileNames(const HBA_WWN& wwpn, RM_DumpFileNames* list);
  /// @param directory TVX_DUMP_DIRECTORY_SIZE bytes, which a text may fill to the last
  static RM_STATUS tvxcimGetDumpDirectory(const HBA_WWN& wwpn, char* directory);
  static RM_STATUS tvxcimSetDumpDirectory(const HBA_WWN& wwpn, const char* path);
  /// How many dump files of a local port are kept; left as it was on failure.
  static RM_STATUS tvxcimGetRetentionCount(const HBA_WWN& wwpn, std::uint32_t* count);
  /// @return RM_ERROR for a count outside TVX_LEAST_RETENTION to TVX_MOST_RETENTION
  static RM_STATUS tvxcimSetRetentionCount(const HBA_WWN& wwpn, std::uint32_t count);

  // Dumps of firmware and processor, and what the firmware logs. No class offers them yet.

  /// @param flag 0 for the port's dump, anything else for the adapter's
  static RM_STATUS tvxcimRetrieveFATDump(int flag, const HBA_WWN& wwpn);
  /// @return 0, or 247 where a reboot has to follow; 251 for a port without core dumps
  static RM_STATUS tvxcimGetCoreDump(const HBA_WWN& wwpn, const char* options);
  /// @param result takes an `RM_EventLogConfig` that the caller owns; left as it was on failure
  /// @return RM_ERROR also for more entries than there is room for
  static RM_STATUS GetExtFATAdvancedData(const HBA_WWN& wwpn, TVX_Block* result);
  /// Sets what one module logs. Texts longer than their 50-byte fields are cut.
  /// @param portMask below 16
  /// @param functionMask below 256
  /// @param value not 0
  static RM_STATUS SetExtFATAdvancedData(const HBA_WWN& wwpn, const char* text1, const char* text2,
                                         std::uint32_t portMask, std::uint32_t functionMask,
                                         std::uint32_t value);
  static RM_STATUS tvxcimSetAdvancedDumpTraceLevel(const HBA_WWN& wwpn, std::uint32_t a,
                                                   std::uint32_t b, std::uint32_t c,
                                                   std::uint32_t d);
  static RM_STATUS tvxcimRestoreDefaultSettings(const HBA_WWN& wwpn);

  /// Remembers every distinct name of one walk in a list that the caller starts as null and 0 and
  /// frees with `freeWWPNList`. 1 if `wwn` is in the list, else 0 with the name added. Without
  /// memory the list is dropped and the result is 0.
  static int isDuplicateEntryInWWPNList(const HBA_WWN* wwn, HBA_WWN*** list, int* count);
  /// Frees such a list and sets it to null and 0.
  static void freeWWPNList(HBA_WWN*** list, int* count);
};

}  // namespace cimrt
