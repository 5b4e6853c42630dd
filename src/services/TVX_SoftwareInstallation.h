// How firmware gets into a port: from the arguments of the two install methods to their result.
#pragma once

#include "rmapi/rmapi.h"
#include "services/Service_Checks.h"

namespace cimrt {

/// Results of the installation service beside those that services share.
inline constexpr std::uint32_t INSTALL_FAILED = 4;
inline constexpr std::uint32_t INSTALL_INVALID_PARAMETER = 5;
inline constexpr std::uint32_t INSTALL_NO_TARGET_OR_URI = 4097;
inline constexpr std::uint32_t INSTALL_FILE_NOT_FOUND = 4107;

/// Options that do something. Others are accepted and have no effect.
inline constexpr std::uint16_t INSTALL_OPTION_RESET = 2;
inline constexpr std::uint16_t INSTALL_OPTION_FILE_NAME = 32768;

/// `Name` of the service that these methods belong to.
inline constexpr const char* INSTALLATION_SERVICE_NAME = "TVXHBA_FCSoftwareInstallationService";

/// What both install methods were given. The arguments belong to the caller.
struct Install_Request {
  Service_Call& call;
  const TVXHBA_SoftwareInstallationService* service;
  const Instance* target;
  const Array<std::uint16_t>& options;
  const Array<String>& values;
  CIM_ConcreteJob*& job;  ///< no job is ever made: it is set to null
};

/// True if the agent knows the service; logged at `level` if not.
bool checkInstallationService(const ProviderAgent& agent,
                              const TVXHBA_SoftwareInstallationService* service, int level);
/// The name of a port, with the reason logged if it can't be converted.
bool installationTargetName(const TVXHBA_FCPort& port, HBA_WWN& wwpn);

/// Installs the file that a URI names. Local files stay; a fetched one is removed after a download
/// that went through.
/// @param status the method's result, which a failed transfer writes to
/// @return the method's result
std::uint32_t installFromURI(const Install_Request& request, const Property<String>& uri,
                             Property<std::uint32_t>& status);
/// Writes the image to the file that the values name, installs that and removes it. Without a
/// reset the data lock is given back and a refresh is begun.
/// @return the method's result
std::uint32_t installFromByteStream(const Install_Request& request,
                                    const Array<std::uint8_t>& image);

}  // namespace cimrt
