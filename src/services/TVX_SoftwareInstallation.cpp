#include "services/TVX_SoftwareInstallation.h"

#include <sys/stat.h>

#include <algorithm>
#include <cerrno>
#include <cstdio>
#include <optional>

#include "access/TVX_MethodWrapper.h"
#include "common/CLogger.h"
#include "common/TVX_File.h"
#include "common/TVX_Uri.h"
#include "runtime/Safe_Open.h"

namespace cimrt {

namespace {

constexpr std::uint16_t ACCEPTED_OPTIONS[] = {2, 4, 5, 6, 7, 11};

/// A check or step: nothing, or the result that ends the method.
using Outcome = std::optional<std::uint32_t>;

/// The port of a request, in the forms that the steps need.
struct Install_Target {
  TVXHBA_FCPort* port = nullptr;
  HBA_WWN wwpn{};
  const char* deviceID() const { return port->DeviceID.value.c_str(); }
};

std::uint32_t ofLibrary(RM_STATUS status) {
  return METHOD_LIBRARY_FAILURE + static_cast<std::uint32_t>(status);
}

bool isAccepted(std::uint16_t option, bool fileNameToo) {
  if (fileNameToo && option == INSTALL_OPTION_FILE_NAME) return true;
  return std::find(std::begin(ACCEPTED_OPTIONS), std::end(ACCEPTED_OPTIONS), option) !=
         std::end(ACCEPTED_OPTIONS);
}

// ---- Checks of the arguments ----

Outcome checkServiceAndTarget(const Install_Request& request, const char* wrongTarget,
                              Install_Target& target) {
  ProviderAgent& agent = request.call.agent;
  if (!checkInstallationService(agent, request.service, TVX_ERR)) return METHOD_UNKNOWN_SERVICE;
  if (!request.target) {
    TVX_LOG(TVX_ERR, "Target has a null pointer");
    return INSTALL_NO_TARGET_OR_URI;
  }
  target.port = findTargetPort(agent, request.target);
  if (target.port) return std::nullopt;
  TVX_LOG(TVX_ERR, "%s", wrongTarget);
  return METHOD_UNKNOWN_PORT;
}

Outcome checkOptions(const Array<std::uint16_t>& options, bool fileNameToo) {
  TVX_LOG(TVX_DBG, "size of InstallOptions array = %d, first member %u",
          static_cast<int>(options.size()), options.size() != 0 ? options[0] : 0U);
  const bool known = std::all_of(options.begin(), options.end(), [&](std::uint16_t option) {
    return isAccepted(option, fileNameToo);
  });
  if (known) return std::nullopt;
  TVX_LOG(TVX_ERR, "invalid value of Install options");
  return INSTALL_INVALID_PARAMETER;
}

/// The file must be there before the adapter is touched.
Outcome checkFile(const char* path) {
  struct stat info;
  if (::stat(path, &info) == 0) return std::nullopt;
  if (errno == ENOENT) {
    TVX_LOG(TVX_ERR, "ERROR: tvxcimDownloadFW: FW file not found");
    return INSTALL_FILE_NOT_FOUND;
  }
  TVX_LOG(TVX_ERR, "ERROR: tvxcimDownloadFW: Can't stat FW file ");
  return INSTALL_INVALID_PARAMETER;
}

Outcome checkNames(const Install_Request& request, Install_Target& target) {
  if (!installationTargetName(*target.port, target.wwpn)) return INSTALL_NO_TARGET_OR_URI;
  const Property<String>& name = request.service->Name;
  if (!name.is_null() && name.value.equali(INSTALLATION_SERVICE_NAME)) return std::nullopt;
  TVX_LOG(TVX_ERR, "Error - The SoftwareInstallationService instance selected is incorrect ");
  return INSTALL_FAILED;
}

/// What stands between the file and its download, in both methods.
Outcome checkFileAndNames(const Install_Request& request, const char* path,
                          Install_Target& target) {
  if (const Outcome wrong = checkFile(path)) return wrong;
  set_reference(request.job, static_cast<CIM_ConcreteJob*>(nullptr));
  return checkNames(request, target);
}

// ---- Steps ----

void removeFile(const char* path) {
  struct stat info;
  if (::stat(path, &info) != 0) {
    TVX_LOG(TVX_DBG, "tvxcimDownloadFW: Can't stat file %s", tvxWithoutPassword(path).c_str());
  } else if (std::remove(path) == 0) {
    TVX_LOG(TVX_DBG, "tvxcimDownloadFW: FW file %s removed successfully",
            tvxWithoutPassword(path).c_str());
  }
}

void tellComplete(const Install_Target& target) {
  TVX_LOG(TVX_WARN, "FC download functionality complete for target %s", target.deviceID());
}

/// Resets the adapter once for each option that asks for it. The first failure ends it.
Outcome resetAsAsked(const Array<std::uint16_t>& options, const Install_Target& target) {
  for (const std::uint16_t option : options) {
    if (option != INSTALL_OPTION_RESET) continue;
    TVX_LOG(TVX_DBG, "HBA RESET OPTION SELECTED");
    const RM_STATUS status = TVX_MethodWrapper::tvxcimReset(&target.wwpn);
    if (status != RM_OK) {
      TVX_LOG(TVX_ERR, "TVXHBA_SoftwareInstallationService_Provider::tvxcimResetHBA failed");
      return ofLibrary(status);
    }
    TVX_LOG(TVX_WARN, "Fiwmware download functionality complete with Reset on the HBA");
  }
  return std::nullopt;
}

/// Downloads the file of a URI and notes in the port how that went.
Outcome downloadNoting(const Install_Target& target, const char* path, RM_STATUS& status) {
  status = TVX_MethodWrapper::tvxcimDownloadFW(&target.wwpn, path);
  if (status == RM_OK) {
    tellComplete(target);
    return std::nullopt;
  }
  if (status == RM_NEED_REBOOT) {
    TVX_LOG(TVX_WARN,
            "FC Firmware download completed for target %s Please reboot system to activate new "
            "firmware.",
            target.deviceID());
    TVX_MethodWrapper::UpdateFirmwareOnFlash(&target.wwpn);
    target.port->FWDownloadStatus.set(ofLibrary(status));
    return std::nullopt;
  }
  TVX_LOG(TVX_ERR, "Error - in the firmware download functionality");
  target.port->FWDownloadStatus.set(ofLibrary(status));
  return ofLibrary(status);
}

std::uint32_t installFile(const Install_Request& request, const Install_Target& target,
                          const char* path, bool fetched) {
  RM_STATUS status = RM_OK;
  if (const Outcome failure = downloadNoting(target, path, status)) return *failure;
  TVX_LOG(TVX_DBG, "tvxcimDownloadFW: Removing the FW file from CIMOM's repository ");
  if (fetched) removeFile(path);
  if (status == RM_NEED_REBOOT) return METHOD_OK;
  if (const Outcome failure = resetAsAsked(request.options, target)) return *failure;
  TVX_MethodWrapper::UpdateFirmwareOnFlash(&target.wwpn);
  return METHOD_OK;
}

/// The name that stands at the index of the last option 32768.
Outcome findFileName(const Install_Request& request, String& name) {
  std::size_t index = request.options.size();
  while (index > 0 && request.options[index - 1] != INSTALL_OPTION_FILE_NAME) index--;
  if (index == 0) {
    TVX_LOG(TVX_ERR, "InstallOptions does not have the value 32768");
    return INSTALL_INVALID_PARAMETER;
  }
  if (index > request.values.size()) {
    TVX_LOG(TVX_ERR,
            "InstallOptionsValues is empty. Should have the correct firmware file name. Returning "
            "Invalid Parameter");
    return INSTALL_INVALID_PARAMETER;
  }
  name = request.values[index - 1];
  return std::nullopt;
}

bool writeAll(std::FILE* file, const Array<std::uint8_t>& image) {
  const std::size_t size = image.size();
  return (size == 0 || std::fwrite(image.begin(), 1, size, file) == size) && std::fflush(file) == 0;
}

/// Writes the image; what could not be written whole does not stay.
Outcome writeImage(const char* path, const Array<std::uint8_t>& image) {
  TVX_File file(open_for_writing(path, "w", LOG_PERMISSIONS));
  const bool opened = file != nullptr;
  if (opened && writeAll(file.get(), image)) return std::nullopt;
  TVX_LOG(TVX_ERR, "Could not open file to copy the firmware from ByteStream");
  file.reset();
  if (opened) removeFile(path);
  return INSTALL_FAILED;
}

Outcome checkByteStream(const Install_Request& request, Install_Target& target, String& path) {
  if (const Outcome wrong = checkServiceAndTarget(
          request, "TVXHBA_SoftwareInstallationService_Provider::Wrong DeviceID passed", target))
    return wrong;
  if (request.values.size() == 0) {
    TVX_LOG(TVX_ERR,
            "InstallOptionsValues is empty. Should have the correct firmware file name. Returning "
            "Invalid Parameter");
    return INSTALL_INVALID_PARAMETER;
  }
  if (const Outcome wrong = checkOptions(request.options, true)) return wrong;
  return findFileName(request, path);
}

bool asksForReset(const Array<std::uint16_t>& options) {
  return options.find(INSTALL_OPTION_RESET) != static_cast<std::size_t>(-1);
}

/// Downloads the written image, which is removed in any case.
Outcome installImage(const Install_Request& request, const Install_Target& target,
                     const char* path) {
  const RM_STATUS status = TVX_MethodWrapper::tvxcimDownloadFW(&target.wwpn, path);
  removeFile(path);
  if (status != RM_OK) {
    TVX_LOG(TVX_ERR, "Error - in the firmware download functionality");
    return ofLibrary(status);
  }
  tellComplete(target);
  return resetAsAsked(request.options, target);
}

}  // namespace

bool checkInstallationService(const ProviderAgent& agent,
                              const TVXHBA_SoftwareInstallationService* service, int level) {
  if (service && isKnownService(agent.m_TVXHBA_SoftwareInstallationService_map, service))
    return true;
  TVX_LOG(level, "Invalid instance of Software Installation Service");
  return false;
}

bool installationTargetName(const TVXHBA_FCPort& port, HBA_WWN& wwpn) {
  char name[TVX_HBA_NAME_LENGTH + 1] = {};
  if (TVX_MethodWrapper::Id2HBAName(name, port.DeviceID.value.c_str()) != RM_OK) {
    TVX_LOG(TVX_ERR, "TVXHBA_SoftwareInstallationService_Provider::Id2HBAName failed");
    return false;
  }
  if (TVX_MethodWrapper::str2HBAName(&wwpn, name) == RM_OK) return true;
  TVX_LOG(TVX_ERR, "TVXHBA_SoftwareInstallationService_Provider::str2HBAName failed");
  return false;
}

std::uint32_t installFromURI(const Install_Request& request, const Property<String>& uri,
                             Property<std::uint32_t>& status) {
  Install_Target target;
  if (const Outcome wrong = checkServiceAndTarget(
          request, "TVXHBA_SoftwareInstallationService_Provider invald port ...return", target))
    return *wrong;
  if (uri.value.empty()) {
    TVX_LOG(TVX_ERR, "Null sized URI..returning");
    return INSTALL_NO_TARGET_OR_URI;
  }
  if (const Outcome wrong = checkOptions(request.options, false)) return *wrong;
  bool fetched = false;
  const String path = TVX_MethodWrapper::downloadFileUsingCurl(uri.value, status, fetched);
  if (!status.is_null() && status.value != METHOD_OK) {
    TVX_LOG(TVX_ERR, "ERROR: CURL returned with Error :%d", static_cast<int>(status.value));
    return INSTALL_FILE_NOT_FOUND;
  }
  TVX_LOG(TVX_DBG, "filename is : %s", tvxWithoutPassword(path.c_str()).c_str());
  if (const Outcome wrong = checkFileAndNames(request, path.c_str(), target)) return *wrong;
  return installFile(request, target, path.c_str(), fetched);
}

std::uint32_t installFromByteStream(const Install_Request& request,
                                    const Array<std::uint8_t>& image) {
  Install_Target target;
  String path;
  if (const Outcome wrong = checkByteStream(request, target, path)) return *wrong;
  TVX_LOG(TVX_DBG, "filename is : %s", path.c_str());
  if (const Outcome wrong = writeImage(path.c_str(), image)) return *wrong;
  if (const Outcome wrong = checkFileAndNames(request, path.c_str(), target)) return *wrong;
  if (const Outcome wrong = installImage(request, target, path.c_str())) return *wrong;
  if (asksForReset(request.options)) return METHOD_OK;
  ProviderAgent& agent = request.call.agent;
  agent.m_bAdapterRefreshPending = true;
  request.call.release();
  agent.BuildCimrtInfo();
  return METHOD_OK;
}

}  // namespace cimrt
