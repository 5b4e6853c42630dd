// Dump files of a port, where they lie and how many are kept; extended event logging.
#include <cstddef>
#include <cstring>
#include <utility>

#include "access/TVX_MethodWrapper.h"
#include "common/CLogger.h"

namespace cimrt {

static_assert(sizeof(RM_EventLogModule) == 112);
static_assert(sizeof(RM_EventLogConfig) == 7220 && offsetof(RM_EventLogConfig, count) == 12);

namespace {

bool isLocal(const HBA_WWN& wwpn) {
  if (TVX_MethodWrapper::Validatewwpn(&wwpn) == RM_OK) return true;
  TVX_LOG(TVX_DBG, "INVALID wwpn");
  return false;
}

/// Logs a failure under its text, which takes the status, and then the library's text for it.
RM_STATUS tellFailure(RM_STATUS status, const char* what) {
  if (status == RM_OK) return status;
  TVX_LOG(TVX_DBG, "%s %d", what, status);
  TVX_MethodWrapper::StatusString(status);
  return status;
}

}  // namespace

// --- Making and removing -------------------------------------------------------------------------

RM_STATUS TVX_MethodWrapper::tvxcimDumpDiagnostic(const HBA_WWN& wwpn, int option) {
  const RM_STATUS status =
      option == TVX_WHOLE_DUMP ? LRM_GenerateDump(0, wwpn) : LRM_GenerateEfdDump(wwpn, option, 0);
  return tellFailure(status, "Failed to generate the dump file, exited with error code");
}

RM_STATUS TVX_MethodWrapper::tvxcimDeleteDumpFiles(const HBA_WWN& wwpn) {
  if (!isLocal(wwpn)) return RM_ERROR;
  const RM_STATUS status = LRM_DeleteDumpFiles(wwpn);
  if (status != RM_OK)
    TVX_LOG(TVX_DBG, "Failed to delete the Dump files, exited with error code %d", status);
  return status;
}

RM_STATUS TVX_MethodWrapper::tvxcimRetrieveFATDump(int flag, const HBA_WWN& wwpn) {
  TVX_LOG(TVX_DBG, "Inside tvxcimRetrieveFATDump ");
  const RM_STATUS status = flag == 0 ? LRM_RetrieveFATDump(wwpn) : LRM_RetrieveFATDump2(wwpn);
  if (status != RM_OK) StatusString(status);
  TVX_LOG(TVX_DBG, "Exiting tvxcimRetrieveFATDump \n");
  return status;
}

RM_STATUS TVX_MethodWrapper::tvxcimGetCoreDump(const HBA_WWN& wwpn, const char* options) {
  if (options == nullptr) return RM_ERROR_INVALID_POINTER;
  TVX_LOG(TVX_DBG, "Options %s", options);
  if (!isLocal(wwpn)) return RM_ERROR;
  std::uint32_t value = 0;
  if (LRM_GetHBAFeature(wwpn, RM_FEATURE_CORE_DUMP, &value) == RM_OK && value != 1)
    return RM_ERROR_NO_CORE_DUMP;
  const RM_STATUS status = LRM_GenerateCoreDump(wwpn, options);
  if (status == RM_NEED_REBOOT) return status;
  return tellFailure(status, "Failed to generate core dump, exited with error code");
}

// --- Names, directory and number -----------------------------------------------------------------

RM_STATUS TVX_MethodWrapper::GetDumpFileNames(const HBA_WWN& wwpn, RM_DumpFileNames* list) {
  TVX_LOG(TVX_DBG, "Entering the Get Dump filenames method");
  if (list == nullptr) {
    TVX_LOG(TVX_DBG, "FileEntriesPointer NULL");
    return RM_ERROR_INVALID_POINTER;
  }
  if (!isLocal(wwpn)) return RM_ERROR;
  const RM_STATUS status = LRM_GetDumpFileNames(wwpn, list);
  if (status != RM_OK) StatusString(status);
  TVX_LOG(TVX_DBG, "Exit the Get Dump filenames method");
  return status;
}

RM_STATUS TVX_MethodWrapper::tvxcimGetDumpDirectory(const HBA_WWN& wwpn, char* directory) {
  const RM_STATUS status = LRM_GetDumpDirectoryA(wwpn, directory, TVX_DUMP_DIRECTORY_SIZE);
  return tellFailure(status, "Failed to get the Dump directory, returned with error code");
}

RM_STATUS TVX_MethodWrapper::tvxcimSetDumpDirectory(const HBA_WWN& wwpn, const char* path) {
  if (path == nullptr) return RM_ERROR_INVALID_POINTER;
  const RM_STATUS status = LRM_SetDumpDirectory(wwpn, path);
  switch (status) {
    case RM_OK:
      TVX_LOG(TVX_DBG, "tvxcimSetDumpDirectory: Success");
      break;
    case RM_ERROR_DIRECTORY:
      TVX_LOG(TVX_DBG,
              "ERROR: tvxcimSetDumpDirectory: RM_SetDumpDirectory call failed. The specified "
              "directory [' / vmfs / volumes / %s'] cannot be opened",
              path);
      break;
    case RM_ERROR_CONFIG_FILE:
    case RM_ERROR_CONFIG_FILE_ALT:
      TVX_LOG(TVX_DBG,
              "ERROR: tvxcimSetDumpDirectory: RM_SetDumpDirectory call failed. The configuration "
              "file could not be opened");
      break;
    default:
      TVX_LOG(TVX_DBG,
              "ERROR: tvxcimSetDumpDirectory: RM_SetDumpDirectory call failed with error code : "
              "%d \n",
              status);
  }
  return status;
}

RM_STATUS TVX_MethodWrapper::tvxcimGetRetentionCount(const HBA_WWN& wwpn, std::uint32_t* count) {
  if (!isLocal(wwpn)) return RM_ERROR;
  const RM_STATUS status = LRM_GetDumpRetentionCount(wwpn, count);
  if (status != RM_OK)
    TVX_LOG(TVX_DBG, "Failed to get the retention count, returned with error code %d", status);
  return status;
}

RM_STATUS TVX_MethodWrapper::tvxcimSetRetentionCount(const HBA_WWN& wwpn, std::uint32_t count) {
  if (count < TVX_LEAST_RETENTION || count > TVX_MOST_RETENTION) {
    TVX_LOG(TVX_DBG, "ERROR: RetentionCount value must be in-between %d and %d",
            static_cast<int>(TVX_LEAST_RETENTION), static_cast<int>(TVX_MOST_RETENTION));
    return RM_ERROR;
  }
  return tellFailure(LRM_SetDumpRetentionCount(wwpn, count),
                     "Failed to set the retention count, exited with error code");
}

// --- Extended event logging ----------------------------------------------------------------------

RM_STATUS TVX_MethodWrapper::GetExtFATAdvancedData(const HBA_WWN& wwpn, TVX_Block* result) {
  TVX_Block block = tvxAllocate(RM_EVENT_LOG_CONFIG_SIZE);
  if (block == nullptr || result == nullptr) {
    TVX_LOG(TVX_CRIT, "ERROR: malloc failed for RM_Get_BE_EventLogConfigDataAll data");
    return RM_ERROR;
  }
  auto* data = reinterpret_cast<RM_EventLogConfig*>(block.get());
  const RM_STATUS status = LRM_Get_BE_EventLogConfigDataAll(wwpn, data);
  TVX_LOG(TVX_DBG, "Returned from RM call: %d, %d, %d", status, static_cast<int>(data->capacity),
          static_cast<int>(data->count));
  if (status == RM_OK && data->count <= data->capacity) {
    *result = std::move(block);
    return RM_OK;
  }
  TVX_LOG(TVX_DBG,
          "RM_Get_BE_EventLogConfigDataAll call failed, with error code : %d, Invalid number of "
          "entries in FAT data : %d",
          status, static_cast<int>(data->count));
  return status != RM_OK ? status : RM_ERROR;
}

RM_STATUS TVX_MethodWrapper::SetExtFATAdvancedData(const HBA_WWN& wwpn, const char* text1,
                                                   const char* text2, std::uint32_t portMask,
                                                   std::uint32_t functionMask,
                                                   std::uint32_t value) {
  if (text1 == nullptr || text2 == nullptr || portMask >= 16 || value == 0 || functionMask >= 256) {
    TVX_LOG(TVX_DBG,
            "Invalid Module Parameter arguments, Valid values are portMask [1-15], "
            "FunctionMask[0-255]");
    return RM_ERROR;
  }
  RM_EventLogModule module{portMask, functionMask, value, {}, {}};
  std::memcpy(module.text1, text1, ::strnlen(text1, sizeof module.text1 - 1));
  std::memcpy(module.text2, text2, ::strnlen(text2, sizeof module.text2 - 1));
  const RM_STATUS status = LRM_Set_BE_EventLogConfigDataModule(wwpn, &module);
  if (status != RM_OK)
    TVX_LOG(TVX_DBG, "Failed to set the advanced settings, returned with error code %d", status);
  return status;
}

RM_STATUS TVX_MethodWrapper::tvxcimSetAdvancedDumpTraceLevel(const HBA_WWN& wwpn, std::uint32_t a,
                                                             std::uint32_t b, std::uint32_t c,
                                                             std::uint32_t d) {
  const RM_STATUS status = LRM_Set_BE_EventLogTraceLevel(wwpn, a, b, c, d);
  if (status != RM_OK)
    TVX_LOG(TVX_DBG, "Failed to set the Advanced Dump TraceLevel, returned with error code %d",
            status);
  return status;
}

RM_STATUS TVX_MethodWrapper::tvxcimRestoreDefaultSettings(const HBA_WWN& wwpn) {
  const RM_STATUS status = LRM_Set_BE_DefaultLoggingConfig(wwpn);
  if (status != RM_OK)
    TVX_LOG(TVX_DBG, "Failed to restore default settings, returned with error code %d", status);
  return status;
}

}  // namespace cimrt
