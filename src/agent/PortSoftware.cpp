// The software of one port: firmware, kernel, boot code, functional firmware stub, driver.
#include "agent/Associations.h"
#include "agent/Identity_Version.h"
#include "agent/Map_Insert.h"
#include "agent/RegisteredProfiles.h"
#include "agent/SoftwareIdentities.h"

namespace cimrt {

namespace {

/// One kind of software that a port carries.
struct Port_Software {
  const char* parsing;      ///< first word of the log lines about its version
  const char* elementName;  ///< before the version, the model and the serial number
  const char* instanceID;   ///< the same for the key
  const char* namePart;     ///< last text of an adapter's name; null: `Name` is `ElementName`
  const char* description;
  std::string FCAdapterAttributes::*version;
  Software_Classification classification;
  const char* failure;    ///< logged when there is no identity
  const char* shortName;  ///< in the texts of its associations
  void (*fill)(TVXHBA_SoftwareIdentity& identity, const FCAdapterAttributes& attributes);
};

/// What the ends of the associations of the port software are called.
struct Software_Texts {
  std::string ofPort;      ///< "<model>:<WWPN>"
  std::string ofIdentity;  ///< "v<version> <model> <serial number>"
};

void fillBootCode(TVXHBA_SoftwareIdentity& identity, const FCAdapterAttributes& attributes) {
  identity.FCUniversalVersion.set(attributes.FCUniversalVersion.c_str());
  identity.OptROMVersion.set(attributes.OptionROMVersion.c_str());
}

void fillFirmware(TVXHBA_SoftwareIdentity& identity, const FCAdapterAttributes& attributes) {
  fillBootCode(identity, attributes);
  identity.OperationalFirmware.set(attributes.OperationalFirmware.c_str());
  identity.FirmwareOnFlash.set(attributes.FirmwareOnFlash.c_str());
  identity.ULPFirmwareVersion.set(attributes.ULPFirmwareVersion.c_str());
  identity.ULPFirmwareName.set(attributes.ULPFirmwareName.c_str());
  identity.SPFirmwareVersion.set(attributes.SPFirmwareVersion.c_str());
  identity.SPFirmwareName.set(attributes.SPFirmwareName.c_str());
  identity.SLI1FirmwareVersion.set(attributes.SLI1FirmwareName.c_str());
  identity.SLI2FirmwareVersion.set(attributes.SLI2FirmwareName.c_str());
  identity.SLI3FirmwareVersion.set(attributes.SLI3FirmwareName.c_str());
  identity.Manufacturer.set(TORVEX_CORPORATION);
}

void fillNothing(TVXHBA_SoftwareIdentity&, const FCAdapterAttributes&) {}

constexpr Port_Software FIRMWARE = {"Firmware",
                                    "FC HBA Firmware",
                                    "TVX FC HBA:Firmware:",
                                    "Firmware",
                                    "Torvex FC HBA Firmware",
                                    &FCAdapterAttributes::FirmwareVersion,
                                    SOFTWARE_FIRMWARE,
                                    "CreateFirmwareIdentityInstance failed",
                                    "Firmware",
                                    fillFirmware};

constexpr Port_Software OTHERS[] = {
    {"FirmwareKernel", "Firmware Kernel", "Firmware Kernel ", nullptr,
     "Torvex FC HBA Firmware Kernel", &FCAdapterAttributes::KernelVersion, SOFTWARE_FIRMWARE,
     "CreateKernelIdentityInstance failed", "Firmware Kernel", fillNothing},
    {"BootCodeExpansionROM", "Boot Code - Expansion ROM", "Boot Code - Expansion ROM ", "BootCode",
     "Torvex FC HBA Boot Code", &FCAdapterAttributes::BootBIOSVersion, SOFTWARE_BOOT_CODE,
     "CreateKernelIdentityInstance failed", "Boot Code - Expansion ROM", fillBootCode},
    {"FunctionalFirmware", "Functional Firmware stub", "Functional Firmware stub ", nullptr,
     "Torvex Functional Firmware", &FCAdapterAttributes::InitialFirmwareLoad, SOFTWARE_FIRMWARE,
     "CreateFunctionalFirmwareIdentityInstance failed", "Functional Firmware stub", fillNothing},
};

Software_Texts softwareTexts(const Port_Build& port, const std::string& version) {
  const FCAdapterAttributes& attributes = port.adapter.attributes;
  return {formatText("%s:%s", attributes.Model.c_str(), port.port.m_Name.c_str()),
          formatText("v%s %s %s", version.c_str(), attributes.Model.c_str(),
                     attributes.SerialNumber.c_str())};
}

Ref<TVXHBA_SoftwareIdentity> makePortIdentity(const Port_Build& port, const Port_Software& kind,
                                              const Software_Texts& texts) {
  const FCAdapterAttributes& attributes = port.adapter.attributes;
  const std::string& version = attributes.*kind.version;
  auto identity = makeInstance<TVXHBA_SoftwareIdentity>();
  const std::string elementName = formatText("%s %s", kind.elementName, texts.ofIdentity.c_str());
  const std::string name = kind.namePart
                               ? formatText("%s %s Adapter %s %s", "Torvex", "Fiber Channel",
                                            attributes.SerialNumber.c_str(), kind.namePart)
                               : elementName;
  identity->InstanceID.set((kind.instanceID + texts.ofIdentity).c_str());
  identity->ElementName.set(elementName.c_str());
  identity->Name.set(name.c_str());
  identity->Description.set(kind.description);
  identity->VersionString.set(version.c_str());
  identity->Classifications.set({kind.classification});
  identity->NodeWWN.set(port.port.m_NodeName.c_str());
  identity->PortWWN.set(port.port.m_Name.c_str());
  setParsedVersion(*identity, kind.parsing, version);
  kind.fill(*identity, attributes);
  return identity;
}

/// The identity in the map: this port's, or the key-equal one that another port made.
TVXHBA_SoftwareIdentity* insertPortIdentity(ProviderAgent& agent,
                                            Ref<TVXHBA_SoftwareIdentity> identity) {
  auto& map = agent.m_TVXHBA_SoftwareIdentity_map;
  const std::string instanceID = identity->InstanceID.value.c_str();
  TVXHBA_SoftwareIdentity* entry =
      insertInto(map, std::move(identity), "Insert Failed : m_TVXHBA_SoftwareIdentity_map");
  return entry ? entry : findByText(map, &TVXHBA_SoftwareIdentity::InstanceID, instanceID);
}

TVXHBA_SoftwareIdentity* buildPortIdentity(Port_Build& port, const Port_Software& kind) {
  ProviderAgent& agent = port.adapter.host.agent;
  const Software_Texts texts = softwareTexts(port, port.adapter.attributes.*kind.version);
  TVXHBA_SoftwareIdentity* identity =
      insertPortIdentity(agent, makePortIdentity(port, kind, texts));
  if (!identity) {
    TVX_LOG(TVX_CRIT, "%s", kind.failure);
    return nullptr;
  }
  createInstalledSoftwareIdentity(agent, identity->InstanceID.value.c_str(),
                                  port.adapter.host.system, identity);
  return identity;
}

void conformToInventory(Port_Build& port, const Port_Software& kind,
                        const TVXHBA_SoftwareIdentity* identity) {
  ProviderAgent& agent = port.adapter.host.agent;
  createSoftwareConformsToProfile(agent,
                                  formatText("%s %s, Software Inventory", kind.shortName,
                                             softwareTexts(port, "").ofPort.c_str()),
                                  findRegisteredProfile(agent, "Software Inventory"), identity);
}

void associateWithChip(Port_Build& port, const TVXHBA_SoftwareIdentity* identity) {
  const FCAdapterAttributes& attributes = port.adapter.attributes;
  auto* association = static_cast<TVXHBA_FirmwareElementSoftwareIdentity*>(createAssociation(
      port.adapter.host.agent, Association_Kind::FIRMWARE_ELEMENT_SOFTWARE_IDENTITY, "", identity,
      port.chip));
  if (association)
    association->PortID.set(formatText("%s:%d", attributes.SerialNumber.c_str(),
                                       static_cast<int>(attributes.PortNumber))
                                .c_str());
}

void buildFirmware(Port_Build& port) {
  TVXHBA_SoftwareIdentity* identity = buildPortIdentity(port, FIRMWARE);
  if (!identity) return;
  conformToInventory(port, FIRMWARE, identity);
  associateWithChip(port, identity);
  createAssociation(port.adapter.host.agent, Association_Kind::INSTALL_SERVICE_AFFECTS_FIRMWARE, "",
                    identity, port.adapter.host.installationService);
}

void tieToPort(Port_Build& port, const char* what, const TVXHBA_SoftwareIdentity* identity) {
  createElementSoftwareIdentity(
      port.adapter.host.agent,
      formatText("Software Identity (%s) %s", what, softwareTexts(port, "").ofPort.c_str()),
      identity, port.fcPort);
}

void buildOther(Port_Build& port, const Port_Software& kind) {
  TVXHBA_SoftwareIdentity* identity = buildPortIdentity(port, kind);
  if (!identity) return;
  tieToPort(port, kind.shortName, identity);
  conformToInventory(port, kind, identity);
}

}  // namespace

std::int32_t buildPortSoftware(Port_Build& port) {
  buildFirmware(port);
  if (port.adapter.attributes.DeviceID != E200_DEVICE_ID)
    for (const Port_Software& kind : OTHERS) buildOther(port, kind);
  tieToPort(port, "Driver",
            findByText(port.adapter.host.agent.m_TVXHBA_SoftwareIdentity_map,
                       &TVXHBA_SoftwareIdentity::InstanceID,
                       driverIdentityInstanceID(port.adapter.attributes)));
  return 0;
}

}  // namespace cimrt
