// Firmware to the flash of a port, and the reset that activates it.
#include <sys/stat.h>

#include <cerrno>

#include "access/TVX_MethodWrapper.h"
#include "common/CLogger.h"
#include "common/TVX_Uri.h"

namespace cimrt {

namespace {

/// Statuses of a download that have a text of their own.
struct Download_Text {
  RM_STATUS status;
  const char* text;
};

constexpr Download_Text DOWNLOAD_TEXTS[] = {
    {148, "\nERROR: RM_DownloadFirmware: Mailbox failed; Internal Driver Error.\n"},
    {149, "\nERROR: RM_DownloadFirmware: Mailbox timed out.\n"},
    {150, "\nERROR: RM_DownloadFirmware: Mailbox busy; retry.\n"},
};

/// Option of the verification: none.
constexpr int VERIFY_OPTION = 0;
/// Option of the download: none.
constexpr int DOWNLOAD_OPTION = 0;
/// Mode of a reset: the adapter as a whole.
constexpr int RESET_MODE = 1;

bool isLocal(const HBA_WWN* wwpn) {
  if (TVX_MethodWrapper::Validatewwpn(wwpn) == RM_OK) return true;
  TVX_LOG(TVX_ERR, "INVALID wwpn");
  return false;
}

bool isThere(const char* path) {
  struct stat info;
  if (::stat(path, &info) == 0) return true;
  if (errno == ENOENT) {
    TVX_LOG(TVX_ERR, "\nERROR: tvxcimDownloadFW: FW file not found");
  } else {
    TVX_LOG(TVX_ERR, "\nERROR: tvxcimDownloadFW: Can't stat FW file");
  }
  return false;
}

void tellDownload(RM_STATUS status) {
  for (const Download_Text& row : DOWNLOAD_TEXTS) {
    if (row.status != status) continue;
    TVX_LOG(TVX_ERR, "%s", row.text);
    return;
  }
  TVX_LOG(TVX_DBG, "\nERROR: RM_DownloadFirmware: status = %d", status);
}

RM_STATUS download(const HBA_WWN& wwpn, const char* path) {
  TVX_LOG(TVX_DBG, "Starting Firmware download");
  const RM_STATUS status = LRM_DownloadFirmware(wwpn, path, DOWNLOAD_OPTION);
  TVX_LOG(TVX_DBG, "Checking Firmware download status");
  tellDownload(status);
  return status;
}

/// Imports, verifies and flashes; the first status that is not 0 ends it.
RM_STATUS flash(const HBA_WWN& wwpn, const char* path) {
  RM_STATUS status = RM_ImportHBAFileA(path);
  TVX_LOG(TVX_DBG, "\n: RM_ImportHBAFile: status = %d", status);
  if (status != RM_OK) return status;
  const HBA_UINT8* b = wwpn.wwn;
  TVX_LOG(TVX_DBG, "wwpn %2x %2x %2x %2x %2x %2x %2x %2x", b[0], b[1], b[2], b[3], b[4], b[5], b[6],
          b[7]);
  status = RM_VerifyFirmwareA(VERIFY_OPTION, wwpn, path);
  TVX_LOG(TVX_DBG, "\n: RM_VerifyFirmware: status = %d", status);
  return status == RM_OK ? download(wwpn, path) : status;
}

}  // namespace

RM_STATUS TVX_MethodWrapper::tvxcimDownloadFW(const HBA_WWN* wwpn, const char* path) {
  TVX_LOG(TVX_DBG, "entering the tvxcimDownloadFW function");
  if (!isLocal(wwpn)) return RM_ERROR;
  const char* const file = path != nullptr ? path : "";
  TVX_LOG(TVX_DBG, "\n firmware file name \"%s\"\n", tvxWithoutPassword(file).c_str());
  if (!isThere(file)) return RM_ERROR;
  const RM_STATUS status = flash(*wwpn, file);
  StatusString(status);
  return status;
}

RM_STATUS TVX_MethodWrapper::tvxcimReset(const HBA_WWN* wwpn) {
  TVX_LOG(TVX_DBG, "TVX_MethodWrapper::tvxcimReset");
  if (!isLocal(wwpn)) return RM_ERROR;
  const RM_STATUS status = LRM_ResetHBA(*wwpn, RESET_MODE);
  if (status != RM_OK) {
    StatusString(status);
    return status;
  }
  char name[TVX_HBA_NAME_LENGTH + 1] = {};
  HBAName2str(name, *wwpn);
  TVX_LOG(TVX_WARN, "WWN %s is reset", name);
  return RM_OK;
}

}  // namespace cimrt
