// One way to make an association of the identities, services and profiles: from its two ends, by a
// table that says what each kind logs and carries.
#pragma once

#include <cstdint>
#include <string>

#include "agent/ProviderAgent.h"

namespace cimrt {

/// Rows of the table.
enum class Association_Kind {
  INSTALLED_SOFTWARE_IDENTITY,          ///< system, identity
  SOFTWARE_CONFORMS_TO_PROFILE,         ///< profile, identity
  PORT_CONTROLLER_CONFORMS_TO_PROFILE,  ///< profile, controller
  FC_PORT_CONFORMS_TO_PROFILE,          ///< profile, port
  RECORD_LOG_CONFORMS_TO_PROFILE,       ///< profile, log
  COMPUTER_SYSTEM_CONFORMS_TO_PROFILE,  ///< profile, system
  INSTALL_SERVICE_CONFORMS_TO_PROFILE,  ///< profile, service
  PROVIDER_SOFTWARE_IDENTITY,           ///< identity, system
  ELEMENT_SOFTWARE_IDENTITY,            ///< identity, element
  FIRMWARE_ELEMENT_SOFTWARE_IDENTITY,   ///< identity, chip
  FC_TAG_ELEMENT_SOFTWARE_IDENTITY,     ///< identity, service
  ELEMENT_CAPABILITIES,                 ///< service, capabilities
  PROVIDER_USE_OF_LOG,                  ///< log, identity
  RECORD_LOG_CAPABILITIES,              ///< log, capabilities
  HOSTED_INSTALLATION_SERVICE,          ///< system, service; so are the other hosted ones
  HOSTED_WWN_SERVICE,
  HOSTED_TAG_SERVICE,
  HOSTED_BOOT_BIOS_SERVICE,
  HOSTED_DRIVER_PARAM_SERVICE,
  REMOTE_HOSTED_ACCESS_POINT,      ///< system, access point
  INSTALL_SERVICE_AFFECTS_SYSTEM,  ///< affected element, service; so are the others
  INSTALL_SERVICE_AFFECTS_FIRMWARE,
  WWN_SERVICE_AFFECTS_SYSTEM,
  WWN_SERVICE_AFFECTS_FC_PORT,
  BOOT_BIOS_SERVICE_AFFECTS_SYSTEM,
  BOOT_BIOS_SERVICE_AFFECTS_FC_PORT,
  DRIVER_PARAM_SERVICE_AFFECTS_FC_PORT,
  TAG_SERVICE_AFFECTS_PORT,
  COUNT
};

/// How the text of a caller is logged.
enum class Entry_Text {
  GENERATING,  ///< "Generating <class> (<text>)"
  PLAIN,       ///< the text as it is
};

/// One kind of association.
struct Association_Rule {
  Association_Kind kind;
  const char* className;
  Instance_Map_Base& (*map)(Agent_Maps& maps);
  Entry_Text entry;
  const char* announcement;        ///< logged first; null: nothing
  const char* creationFailure;     ///< logged when there is no instance to be had
  const char* insertFailure;       ///< logged when the map refuses it
  std::uint16_t upgradeCondition;  ///< value of the property of that name; 0: leave it
  bool inUse;  ///< `ElementSoftwareStatus` gets its two values, current and installed
};

/// The row of a kind.
const Association_Rule& associationRule(Association_Kind kind);

/// Logs `text` (unless it is empty), makes the association between clones of both ends, in the
/// order of the references of its class, and inserts it. The entry, owned by its map; or null, with
/// the failure logged at `TVX_CRIT`, or with nothing logged but the text when an end is null.
/// Runs on the refresh thread with the agent's map and data locks held.
Instance* createAssociation(ProviderAgent& agent, Association_Kind kind, const std::string& text,
                            const Instance* first, const Instance* second);

// The kinds that several builders make, by name. A failure stops no caller: nobody looks at it.
void createInstalledSoftwareIdentity(ProviderAgent& agent, const std::string& text,
                                     const CIM_ComputerSystem* system,
                                     const TVXHBA_SoftwareIdentity* identity);
void createSoftwareConformsToProfile(ProviderAgent& agent, const std::string& text,
                                     const TVXHBA_RegisteredProfile* profile,
                                     const TVXHBA_SoftwareIdentity* identity);
void createPortControllerConformsToProfile(ProviderAgent& agent, const std::string& text,
                                           const TVXHBA_RegisteredProfile* profile,
                                           const TVXHBA_PortController* controller);
void createFCPortConformsToProfile(ProviderAgent& agent, const std::string& text,
                                   const TVXHBA_RegisteredProfile* profile,
                                   const TVXHBA_FCPort* port);
void createRecordLogConformsToProfile(ProviderAgent& agent, const std::string& text,
                                      const TVXHBA_RegisteredProfile* profile,
                                      const TVXHBA_RecordLog* log);
void createProviderSoftwareIdentity(ProviderAgent& agent, const std::string& text,
                                    const TVXHBA_SoftwareIdentity* identity,
                                    const CIM_ComputerSystem* system);
void createElementSoftwareIdentity(ProviderAgent& agent, const std::string& text,
                                   const TVXHBA_SoftwareIdentity* identity,
                                   const Instance* element);

}  // namespace cimrt
