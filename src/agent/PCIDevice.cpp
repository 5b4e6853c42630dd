// A port as a PCI device, with the registers of its chip family.
#include <iterator>

#include "access/TVX_MethodWrapper.h"
#include "agent/MapSteps.h"
#include "agent/Map_Insert.h"
#include "agent/RegisteredProfiles.h"

namespace cimrt {

namespace {

/// A 32-bit register of `Family` and the property that shows it.
template <class Family>
struct Register_Row {
  Property<std::uint32_t> TVXHBA_PCIDevice::*property;
  std::uint32_t Family::*field;
};

using Device = TVXHBA_PCIDevice;

constexpr Register_Row<RM_PCIPower> POWER[] = {
    {&Device::PwrMgtCaps, &RM_PCIPower::pwrMgtCaps},
    {&Device::PwrMgtCtrl, &RM_PCIPower::pwrMgtCtrl},
    {&Device::MSICtrl, &RM_PCIPower::msiCtrl},
    {&Device::MSILowAddr, &RM_PCIPower::msiLowAddr},
    {&Device::MSIHighAddr, &RM_PCIPower::msiHighAddr},
    {&Device::MSIData, &RM_PCIPower::msiData},
};

constexpr Register_Row<RM_PCIExpress> EXPRESS[] = {
    {&Device::PCIECap, &RM_PCIExpress::cap},
    {&Device::PCIEDeviceCapReg, &RM_PCIExpress::deviceCap},
    {&Device::PCIEDeviceStatusCtrl, &RM_PCIExpress::deviceStatusCtrl},
    {&Device::PCIEDeviceLinkCap, &RM_PCIExpress::linkCap},
    {&Device::PCIEDeviceLinkStatusCtrl, &RM_PCIExpress::linkStatusCtrl},
};

constexpr Register_Row<RM_PCIXFamily> PCIX[] = {
    {&Device::FeatureEnable, &RM_PCIXFamily::featureEnable},
    {&Device::PCIXCommand, &RM_PCIXFamily::pcixCommand},
    {&Device::PCIXStatus, &RM_PCIXFamily::pcixStatus},
};

constexpr Register_Row<RM_PCIXFamily> ECC[] = {
    {&Device::ECCControlStatus, &RM_PCIXFamily::eccControlStatus},
    {&Device::ECCFirstAddress, &RM_PCIXFamily::eccFirstAddress},
    {&Device::ECCSecondAddress, &RM_PCIXFamily::eccSecondAddress},
    {&Device::ECCAttribute, &RM_PCIXFamily::eccAttribute},
};

constexpr Register_Row<RM_PCIBriscaFamily> BRISCA[] = {
    {&Device::MSIMaskBits, &RM_PCIBriscaFamily::msiMaskBits},
    {&Device::MSIPendingBits, &RM_PCIBriscaFamily::msiPendingBits},
    {&Device::MSIXCtrl, &RM_PCIBriscaFamily::msixCtrl},
    {&Device::MSIXTableOffset, &RM_PCIBriscaFamily::msixTableOffset},
    {&Device::MSIXPBAOffset, &RM_PCIBriscaFamily::msixPBAOffset},
    {&Device::VPDAddr, &RM_PCIBriscaFamily::vpdAddr},
    {&Device::SlotCap, &RM_PCIBriscaFamily::slotCap},
    {&Device::SlotStatusCtrlReg, &RM_PCIBriscaFamily::slotStatusCtrlReg},
    {&Device::RootCapCtrlReg, &RM_PCIBriscaFamily::rootCapCtrlReg},
    {&Device::RootStatusReg, &RM_PCIBriscaFamily::rootStatusReg},
    {&Device::DeviceCap2Reg, &RM_PCIBriscaFamily::deviceCap2Reg},
    {&Device::DeviceStatusCtl2Reg, &RM_PCIBriscaFamily::deviceStatusCtl2Reg},
    {&Device::LinkCap2Reg, &RM_PCIBriscaFamily::linkCap2Reg},
    {&Device::LinkStatus2Ctl2Reg, &RM_PCIBriscaFamily::linkStatus2Ctl2Reg},
    {&Device::SlotCap2Reg, &RM_PCIBriscaFamily::slotCap2Reg},
    {&Device::SlotStatusCtl2Reg, &RM_PCIBriscaFamily::slotStatusCtl2Reg},
    {&Device::EnhancedCapHdrAER, &RM_PCIBriscaFamily::enhancedCapHdrAER},
    {&Device::UncorrectableErrStat, &RM_PCIBriscaFamily::uncorrectableErrStat},
    {&Device::UncorrectableErrMask, &RM_PCIBriscaFamily::uncorrectableErrMask},
    {&Device::UncorrectableErrSeverity, &RM_PCIBriscaFamily::uncorrectableErrSeverity},
    {&Device::CorrectableErrStat, &RM_PCIBriscaFamily::correctableErrStat},
    {&Device::CorrectableErrMask, &RM_PCIBriscaFamily::correctableErrMask},
    {&Device::AdvErrCapCtl, &RM_PCIBriscaFamily::advErrCapCtl},
    {&Device::EnhancedCapHdrPBUDG, &RM_PCIBriscaFamily::enhancedCapHdrPBUDG},
    {&Device::DataSelectReg, &RM_PCIBriscaFamily::dataSelectReg},
    {&Device::DataReg, &RM_PCIBriscaFamily::dataReg},
    {&Device::PowerBudget, &RM_PCIBriscaFamily::powerBudget},
};

constexpr Property<std::uint32_t> Device::*HEADER_LOG[] = {
    &Device::HeaderLog0x0, &Device::HeaderLog0x4, &Device::HeaderLog0x8, &Device::HeaderLog0xC};

constexpr Property<std::uint32_t> Device::*BASE_ADDRESSES[] = {
    &Device::BaseAddresses0, &Device::BaseAddresses1, &Device::BaseAddresses2,
    &Device::BaseAddresses3, &Device::BaseAddresses4, &Device::BaseAddresses5};

template <class Family, std::size_t N>
void setRegisters(Device& device, const Register_Row<Family> (&rows)[N], const Family& from) {
  for (const Register_Row<Family>& row : rows) (device.*row.property).set(from.*row.field);
}

void setVpd(Device& device, const RM_PCIVpd& from) {
  device.VPDAddr.set(from.addr);
  device.VPDData.set({from.data});
}

void setTamirol(Device& device, const RM_PCIRegisters& from) {
  TVX_LOG(TVX_DBG, "Creating TVXHBA_PCIDevice for Tamirol");
  setRegisters(device, PCIX, from.family.pcix);
  setRegisters(device, POWER, from.family.pcix.power);
  setVpd(device, from.family.pcix.vpd);
}

void setKora(Device& device, const RM_PCIRegisters& from) {
  TVX_LOG(TVX_DBG, "Creating TVXHBA_PCIDevice for KORA");
  setRegisters(device, PCIX, from.family.pcix);
  setRegisters(device, POWER, from.family.pcix.power);
  setVpd(device, from.family.pcix.vpd);
  device.HotSwap.set(from.family.pcix.hotSwap);
}

void setVestra(Device& device, const RM_PCIRegisters& from) {
  TVX_LOG(TVX_DBG, "Creating TVXHBA_PCIDevice for Vestra");
  setRegisters(device, PCIX, from.family.pcix);
  setRegisters(device, ECC, from.family.pcix);
  setRegisters(device, POWER, from.family.pcix.power);
  setVpd(device, from.family.pcix.vpd);
  device.HotSwap.set(from.family.pcix.hotSwap);
}

void setOndrel(Device& device, const RM_PCIRegisters& from) {
  TVX_LOG(TVX_DBG, "Creating TVXHBA_PCIDevice for Ondrel ");
  device.FeatureEnable.set(from.family.ondrel.featureEnable);
  setRegisters(device, EXPRESS, from.family.ondrel.express);
  setVpd(device, from.family.ondrel.vpd);
  setRegisters(device, POWER, from.family.ondrel.power);
}

void setBrisca(Device& device, const RM_PCIRegisters& from) {
  TVX_LOG(TVX_DBG, "Creating TVXHBA_PCIDevice for Brisca ");
  setRegisters(device, BRISCA, from.family.brisca);
  setRegisters(device, EXPRESS, from.family.brisca.express);
  setRegisters(device, POWER, from.family.brisca.power);
  for (std::size_t i = 0; i < std::size(HEADER_LOG); i++)
    (device.*HEADER_LOG[i]).set(from.family.brisca.headerLog[i]);
}

void setFamily(Device& device, const RM_PCIRegisters& from) {
  switch (from.header.pciType) {
    case RM_PCI_NONE:
      return;
    case RM_PCI_TAMIROL:
      return setTamirol(device, from);
    case RM_PCI_KORA:
      return setKora(device, from);
    case RM_PCI_VESTRA:
      return setVestra(device, from);
    case RM_PCI_ONDREL:
      return setOndrel(device, from);
    default:
      return setBrisca(device, from);
  }
}

void setIdentity(Device& device, const RM_PCIHeader& from) {
  device.PCIType.set(from.pciType);
  device.VendorID.set(from.vendorId);
  device.SubVendorID.set(from.subVendorId);
  device.SubsystemID.set(from.subsystemId);
  device.RevisionID.set(from.revisionId);
  device.ProgIf.set(from.progIf);
  device.SubClass.set(from.subClass);
  device.BaseClass.set(from.baseClass);
  device.HeaderType.set(from.headerType);
}

void setHeader(Device& device, const RM_PCIHeader& from) {
  setIdentity(device, from);
  device.Command.set(from.command);
  device.PCIStatus.set(from.status);
  device.CacheLineSize.set(from.cacheLineSize);
  device.LatencyTimer.set(from.latencyTimer);
  device.BuiltInSelfTest.set(from.builtInSelfTest);
  for (std::size_t i = 0; i < std::size(BASE_ADDRESSES); i++)
    (device.*BASE_ADDRESSES[i]).set(from.baseAddresses[i]);
  device.CIS.set(from.cis);
  device.ExpansionROMBaseAddress.set(from.expansionROMBaseAddress);
  device.CapabilitiesPtr.set(from.capabilitiesPtr);
  device.InterruptLine.set(from.interruptLine);
  device.InterruptPin.set(from.interruptPin);
  device.MinimumGrant.set(from.minimumGrant);
  device.MaximumLatency.set(from.maximumLatency);
}

/// The port's registers; cleared ones, with a message, if they cannot be read.
RM_PCIRegisters readRegisters(HBA_WWN wwpn) {
  RM_PCIRegisters registers{};
  std::uint32_t size = sizeof registers;
  const RM_STATUS status = LRM_DiagReadPCIRegistersV2(wwpn, &registers, &size);
  if (status == 0) return registers;
  TVX_LOG(TVX_CRIT, "RM_DiagReadPCIRegistersV2 call failedi with %d", status);
  return RM_PCIRegisters{};
}

Ref<Device> describeDevice(const Port_Build& build, const RM_PCIRegisters& registers) {
  const CIM_ComputerSystem& system = *build.adapter.host.system;
  Ref<Device> device = makeInstance<Device>();
  device->SystemCreationClassName.set(system.CreationClassName.value);
  device->SystemName.set(system.Name.value);
  device->CreationClassName.set("TVXHBA_PCIDevice");
  device->DeviceID.set(
      formatText("%s:0x%04X", build.port.m_Name.c_str(), registers.header.deviceId).c_str());
  device->ElementName.set(
      formatText("Torvex:FCAdapter%d", static_cast<int>(build.adapter.index)).c_str());
  device->EnabledState.set(5);
  device->RequestedState.set(5);
  device->PrimaryStatus.set(1);
  device->HealthState.set(5);
  setHeader(*device.get(), registers.header);
  setFamily(*device.get(), registers);
  return device;
}

/// The port's name in the form that the library takes.
bool convertName(const std::string& wwpn, HBA_WWN& wwn) {
  char hbaName[TVX_HBA_NAME_LENGTH + 1];
  if (TVX_MethodWrapper::Id2HBAName(hbaName, wwpn.c_str()) != 0) {
    TVX_LOG(TVX_ERR, "TVXHBA_PCIPort Id2HBAName failed");
    return false;
  }
  return TVX_MethodWrapper::string2HBAName(&wwn, wwpn.c_str()) == 1;
}

}  // namespace

namespace {

/// 0, MAP_BUILD_FAILED, or MAP_BUILD_LEAVE_PORT for a port without a PCI view.
std::int32_t conformDevice(ProviderAgent& agent, const Device* device) {
  const TVXHBA_RegisteredProfile* profile = findRegisteredProfile(agent, "PCI Device");
  Ref<TVXHBA_PCIElementConformsToProfile> conformance = madeOrNull([&] {
    return profile ? makeAssociation<TVXHBA_PCIElementConformsToProfile>(profile, device)
                   : Ref<TVXHBA_PCIElementConformsToProfile>();
  });
  if (!conformance) {
    TVX_LOG(TVX_CRIT, "Failed to create TVXHBA_PCIElementConformsToProfile");
    return MAP_BUILD_LEAVE_PORT;
  }
  return insertInto(agent.m_TVXHBA_PCIElementConformsToProfile_map, std::move(conformance),
                    "Insert Failed : m_TVXHBA_PCIElementConformsToProfile_map")
             ? 0
             : MAP_BUILD_FAILED;
}

/// The device in the system.
std::int32_t placeDevice(const Host_Build& host, const Device* device) {
  Ref<TVXHBA_SystemDevice> place =
      madeOrNull([&] { return makeAssociation<TVXHBA_SystemDevice>(host.system, device); });
  if (!place) {
    TVX_LOG(TVX_CRIT, "Failed to create TVXHBA_SystemDevice");
    return MAP_BUILD_FAILED;
  }
  return insertInto(host.agent.m_TVXHBA_SystemDevice_map, std::move(place),
                    "Insert Failed : m_TVXHBA_SystemDevice_map")
             ? 0
             : MAP_BUILD_FAILED;
}

std::int32_t buildDevice(Port_Build& build) {
  const Host_Build& host = build.adapter.host;
  HBA_WWN wwpn{};
  if (!convertName(build.port.m_Name, wwpn)) return MAP_BUILD_FAILED;
  build.pciDevice =
      insertInto(host.agent.m_TVXHBA_PCIDevice_map, describeDevice(build, readRegisters(wwpn)),
                 "Insert Failed : m_TVXHBA_PCIDevice_map");
  if (!build.pciDevice) return MAP_BUILD_FAILED;
  const std::int32_t result = conformDevice(host.agent, build.pciDevice);
  if (result != 0) return result;
  return placeDevice(host, build.pciDevice);
}

}  // namespace

std::int32_t CreatePCIDeviceInstance(Port_Build& build) {
  const std::int32_t result = buildDevice(build);
  if (result == MAP_BUILD_FAILED) TVX_LOG(TVX_CRIT, "CreatePCIDeviceInstance failed");
  return result;
}

}  // namespace cimrt
