// A port as a PCI device: the header and the registers of each chip family.
#include <cstddef>
#include <string>
#include <vector>

#include "Map_Test.h"
#include "agent/MapSteps.h"
#include "rmapi/rmapi_pci.h"

namespace cimrt::test {
namespace {

class PCI_Device : public Adapter_Maps {
 protected:
  /// The PCI device of a host with one port of that family.
  const TVXHBA_PCIDevice& device(const std::string& family) {
    ProviderAgent& agent =
        build(R"({"cards": [{"ports": [{"wwpn": "10000254560C4110", "pci": {"family": )" + family +
              R"(, "vendor_id": "0x117A", "device_id": "0xE300", "subsystem_id": "0xE312",
            "revision": 3, "interrupt_line": 11}}]}]})");
    EXPECT_EQ(agent.m_TVXHBA_PCIDevice_map.size(), 1u);
    return *agent.m_TVXHBA_PCIDevice_map[0];
  }
};

/// The simulated library fills the family's registers with their own numbers.
constexpr std::uint32_t FIRST_WORD = 0x50000000;

std::uint32_t word(std::size_t offset) {
  return FIRST_WORD + static_cast<std::uint32_t>(offset / sizeof(std::uint32_t));
}

void expectPower(const TVXHBA_PCIDevice& device, std::size_t at) {
  EXPECT_EQ(device.PwrMgtCaps.value, word(at + offsetof(RM_PCIPower, pwrMgtCaps)));
  EXPECT_EQ(device.PwrMgtCtrl.value, word(at + offsetof(RM_PCIPower, pwrMgtCtrl)));
  EXPECT_EQ(device.MSICtrl.value, word(at + offsetof(RM_PCIPower, msiCtrl)));
  EXPECT_EQ(device.MSILowAddr.value, word(at + offsetof(RM_PCIPower, msiLowAddr)));
  EXPECT_EQ(device.MSIHighAddr.value, word(at + offsetof(RM_PCIPower, msiHighAddr)));
  EXPECT_EQ(device.MSIData.value, word(at + offsetof(RM_PCIPower, msiData)));
}

void expectExpress(const TVXHBA_PCIDevice& device, std::size_t at) {
  EXPECT_EQ(device.PCIECap.value, word(at + offsetof(RM_PCIExpress, cap)));
  EXPECT_EQ(device.PCIEDeviceCapReg.value, word(at + offsetof(RM_PCIExpress, deviceCap)));
  EXPECT_EQ(device.PCIEDeviceStatusCtrl.value,
            word(at + offsetof(RM_PCIExpress, deviceStatusCtrl)));
  EXPECT_EQ(device.PCIEDeviceLinkCap.value, word(at + offsetof(RM_PCIExpress, linkCap)));
  EXPECT_EQ(device.PCIEDeviceLinkStatusCtrl.value,
            word(at + offsetof(RM_PCIExpress, linkStatusCtrl)));
}

void expectVpd(const TVXHBA_PCIDevice& device, std::size_t at) {
  EXPECT_EQ(device.VPDAddr.value, word(at + offsetof(RM_PCIVpd, addr)));
  EXPECT_EQ(numbers(device.VPDData),
            (std::vector<std::uint32_t>{word(at + offsetof(RM_PCIVpd, data))}));
}

void expectPcix(const TVXHBA_PCIDevice& device) {
  EXPECT_EQ(device.FeatureEnable.value, word(offsetof(RM_PCIXFamily, featureEnable)));
  EXPECT_EQ(device.PCIXCommand.value, word(offsetof(RM_PCIXFamily, pcixCommand)));
  EXPECT_EQ(device.PCIXStatus.value, word(offsetof(RM_PCIXFamily, pcixStatus)));
  expectPower(device, offsetof(RM_PCIXFamily, power));
  expectVpd(device, offsetof(RM_PCIXFamily, vpd));
  EXPECT_TRUE(device.PCIECap.is_null());
  EXPECT_TRUE(device.SlotCap.is_null());
}

TEST_F(PCI_Device, CarriesItsIdentityAndTheHeader) {
  const TVXHBA_PCIDevice& device = this->device("\"none\"");
  EXPECT_EQ(text(device.SystemCreationClassName), "CIM_ComputerSystem");
  EXPECT_EQ(text(device.CreationClassName), "TVXHBA_PCIDevice");
  EXPECT_EQ(text(device.DeviceID), "10000254560C4110:0xE300");
  EXPECT_EQ(text(device.ElementName), "Torvex:FCAdapter0");
  EXPECT_EQ(device.EnabledState.value, 5);
  EXPECT_EQ(device.RequestedState.value, 5);
  EXPECT_EQ(device.PrimaryStatus.value, 1);
  EXPECT_EQ(device.HealthState.value, 5);
  EXPECT_EQ(device.VendorID.value, 0x117A);
  EXPECT_EQ(device.SubVendorID.value, 0x117A);
  EXPECT_EQ(device.SubsystemID.value, 0xE312);
  EXPECT_EQ(device.RevisionID.value, 3);
  EXPECT_EQ(device.InterruptLine.value, 11);
  EXPECT_EQ(device.InterruptPin.value, 1);
  EXPECT_EQ(device.Command.value, 0x0546);
  EXPECT_EQ(device.PCIStatus.value, 0x0010);
  EXPECT_EQ(device.BaseClass.value, 0x0C);
  EXPECT_EQ(device.SubClass.value, 0x04);
  EXPECT_EQ(device.ProgIf.value, 0);
  EXPECT_EQ(device.CacheLineSize.value, 16);
  EXPECT_EQ(device.HeaderType.value, 0x80);
  EXPECT_EQ(device.BaseAddresses0.value, 0xF7E00004u);
  EXPECT_EQ(device.BaseAddresses2.value, 0xF7D00004u);
  EXPECT_EQ(device.ExpansionROMBaseAddress.value, 0xF7C00000u);
  EXPECT_EQ(device.CapabilitiesPtr.value, 0x54);
  EXPECT_EQ(device.PCIType.value, 0u);
}

TEST_F(PCI_Device, EveryHeaderPropertyIsSetThoughItsRegisterIsZero) {
  const TVXHBA_PCIDevice& device = this->device("\"none\"");
  for (const auto* byte : {&device.ProgIf, &device.LatencyTimer, &device.BuiltInSelfTest,
                           &device.MinimumGrant, &device.MaximumLatency})
    EXPECT_FALSE(byte->is_null());
  for (const auto* address : {&device.BaseAddresses1, &device.BaseAddresses3,
                              &device.BaseAddresses4, &device.BaseAddresses5, &device.CIS})
    EXPECT_FALSE(address->is_null());
}

TEST_F(PCI_Device, WithoutFamilyHasTheHeaderAlone) {
  const TVXHBA_PCIDevice& device = this->device("\"none\"");
  EXPECT_TRUE(device.FeatureEnable.is_null());
  EXPECT_TRUE(device.PwrMgtCaps.is_null());
  EXPECT_TRUE(device.VPDAddr.is_null());
  for (const char* name : {"Vestra", "Tamirol", "KORA", "Ondrel ", "Brisca "})
    EXPECT_EQ(log.count(std::string("Creating TVXHBA_PCIDevice for ") + name), 0u);
}

TEST_F(PCI_Device, Tamirol) {
  const TVXHBA_PCIDevice& device = this->device("\"tamirol\"");
  EXPECT_EQ(log.count("Creating TVXHBA_PCIDevice for Tamirol"), 1u);
  expectPcix(device);
  EXPECT_TRUE(device.HotSwap.is_null());
  EXPECT_TRUE(device.ECCAttribute.is_null());
}

TEST_F(PCI_Device, Kora) {
  const TVXHBA_PCIDevice& device = this->device("\"kora\"");
  EXPECT_EQ(log.count("Creating TVXHBA_PCIDevice for KORA"), 1u);
  expectPcix(device);
  EXPECT_EQ(device.HotSwap.value, word(offsetof(RM_PCIXFamily, hotSwap)));
  EXPECT_TRUE(device.ECCAttribute.is_null());
}

TEST_F(PCI_Device, Vestra) {
  const TVXHBA_PCIDevice& device = this->device("\"vestra\"");
  EXPECT_EQ(log.count("Creating TVXHBA_PCIDevice for Vestra"), 1u);
  expectPcix(device);
  EXPECT_EQ(device.HotSwap.value, word(offsetof(RM_PCIXFamily, hotSwap)));
  EXPECT_EQ(device.ECCControlStatus.value, word(offsetof(RM_PCIXFamily, eccControlStatus)));
  EXPECT_EQ(device.ECCFirstAddress.value, word(offsetof(RM_PCIXFamily, eccFirstAddress)));
  EXPECT_EQ(device.ECCSecondAddress.value, word(offsetof(RM_PCIXFamily, eccSecondAddress)));
  EXPECT_EQ(device.ECCAttribute.value, word(offsetof(RM_PCIXFamily, eccAttribute)));
}

TEST_F(PCI_Device, Ondrel) {
  const TVXHBA_PCIDevice& device = this->device("\"ondrel\"");
  EXPECT_EQ(log.count("Creating TVXHBA_PCIDevice for Ondrel "), 1u);
  EXPECT_EQ(device.FeatureEnable.value, word(offsetof(RM_PCIOndrelFamily, featureEnable)));
  expectExpress(device, offsetof(RM_PCIOndrelFamily, express));
  expectVpd(device, offsetof(RM_PCIOndrelFamily, vpd));
  expectPower(device, offsetof(RM_PCIOndrelFamily, power));
  EXPECT_TRUE(device.PCIXCommand.is_null());
  EXPECT_TRUE(device.SlotCap.is_null());
}

TEST_F(PCI_Device, BriscaAndWhateverComesAfterIt) {
  const TVXHBA_PCIDevice& device = this->device("9");
  EXPECT_EQ(device.PCIType.value, 9u);
  EXPECT_EQ(log.count("Creating TVXHBA_PCIDevice for Brisca "), 1u);
  expectExpress(device, offsetof(RM_PCIBriscaFamily, express));
  expectPower(device, offsetof(RM_PCIBriscaFamily, power));
  const struct {
    const Property<std::uint32_t>& property;
    std::size_t offset;
  } rows[] = {
      {device.MSIMaskBits, offsetof(RM_PCIBriscaFamily, msiMaskBits)},
      {device.MSIPendingBits, offsetof(RM_PCIBriscaFamily, msiPendingBits)},
      {device.MSIXCtrl, offsetof(RM_PCIBriscaFamily, msixCtrl)},
      {device.MSIXTableOffset, offsetof(RM_PCIBriscaFamily, msixTableOffset)},
      {device.MSIXPBAOffset, offsetof(RM_PCIBriscaFamily, msixPBAOffset)},
      {device.VPDAddr, offsetof(RM_PCIBriscaFamily, vpdAddr)},
      {device.SlotCap, offsetof(RM_PCIBriscaFamily, slotCap)},
      {device.SlotStatusCtrlReg, offsetof(RM_PCIBriscaFamily, slotStatusCtrlReg)},
      {device.RootCapCtrlReg, offsetof(RM_PCIBriscaFamily, rootCapCtrlReg)},
      {device.RootStatusReg, offsetof(RM_PCIBriscaFamily, rootStatusReg)},
      {device.DeviceCap2Reg, offsetof(RM_PCIBriscaFamily, deviceCap2Reg)},
      {device.DeviceStatusCtl2Reg, offsetof(RM_PCIBriscaFamily, deviceStatusCtl2Reg)},
      {device.LinkCap2Reg, offsetof(RM_PCIBriscaFamily, linkCap2Reg)},
      {device.LinkStatus2Ctl2Reg, offsetof(RM_PCIBriscaFamily, linkStatus2Ctl2Reg)},
      {device.SlotCap2Reg, offsetof(RM_PCIBriscaFamily, slotCap2Reg)},
      {device.SlotStatusCtl2Reg, offsetof(RM_PCIBriscaFamily, slotStatusCtl2Reg)},
      {device.EnhancedCapHdrAER, offsetof(RM_PCIBriscaFamily, enhancedCapHdrAER)},
      {device.UncorrectableErrStat, offsetof(RM_PCIBriscaFamily, uncorrectableErrStat)},
      {device.UncorrectableErrMask, offsetof(RM_PCIBriscaFamily, uncorrectableErrMask)},
      {device.UncorrectableErrSeverity, offsetof(RM_PCIBriscaFamily, uncorrectableErrSeverity)},
      {device.CorrectableErrStat, offsetof(RM_PCIBriscaFamily, correctableErrStat)},
      {device.CorrectableErrMask, offsetof(RM_PCIBriscaFamily, correctableErrMask)},
      {device.AdvErrCapCtl, offsetof(RM_PCIBriscaFamily, advErrCapCtl)},
      {device.HeaderLog0x0, offsetof(RM_PCIBriscaFamily, headerLog)},
      {device.HeaderLog0x4, offsetof(RM_PCIBriscaFamily, headerLog) + 4},
      {device.HeaderLog0x8, offsetof(RM_PCIBriscaFamily, headerLog) + 8},
      {device.HeaderLog0xC, offsetof(RM_PCIBriscaFamily, headerLog) + 12},
      {device.EnhancedCapHdrPBUDG, offsetof(RM_PCIBriscaFamily, enhancedCapHdrPBUDG)},
      {device.DataSelectReg, offsetof(RM_PCIBriscaFamily, dataSelectReg)},
      {device.DataReg, offsetof(RM_PCIBriscaFamily, dataReg)},
      {device.PowerBudget, offsetof(RM_PCIBriscaFamily, powerBudget)},
  };
  for (const auto& row : rows) EXPECT_EQ(row.property.value, word(row.offset)) << row.offset;
  EXPECT_TRUE(device.VPDData.is_null());
  EXPECT_TRUE(device.FeatureEnable.is_null());
}

TEST_F(PCI_Device, FailedReadGivesAnInstanceOfClearedRegisters) {
  useScenario(TWO_CARDS);
  addFault(R"({"call": "LRM_DiagReadPCIRegistersV2", "status": 63})");
  ProviderAgent& agent = rebuild();
  EXPECT_EQ(log.level("RM_DiagReadPCIRegistersV2 call failedi with 63"), TVX_CRIT);
  ASSERT_EQ(agent.m_TVXHBA_PCIDevice_map.size(), 4u);
  const TVXHBA_PCIDevice& device = *agent.m_TVXHBA_PCIDevice_map[0];
  EXPECT_EQ(text(device.DeviceID), "10000254560C4110:0x0000");
  EXPECT_EQ(device.VendorID.value, 0);
  EXPECT_EQ(device.PCIType.value, 0u);
  EXPECT_EQ(agent.m_TVXHBA_FCPort_map.size(), 4u);
}

TEST_F(PCI_Device, StandsInTheSystemAndConformsToItsProfile) {
  ProviderAgent& agent = build();
  for (std::size_t i = 0; i < 4; i++) {
    EXPECT_TRUE(ties(*agent.m_TVXHBA_SystemDevice_map[i], agent.m_CIM_ComputerSystem_map[0],
                     agent.m_TVXHBA_PCIDevice_map[i]));
    const auto& conformance = *agent.m_TVXHBA_PCIElementConformsToProfile_map[i];
    EXPECT_TRUE(conformance.ConformantStandard &&
                identical(conformance.ManagedElement, agent.m_TVXHBA_PCIDevice_map[i]));
  }
}

TEST_F(PCI_Device, PortWithoutPCIProfileIsLeftWithoutFurtherClasses) {
  ProviderAgent& agent = build();
  Ranked_Lock maps(agent.m_AdapterMapsReadyMutex);
  Ranked_Lock data(agent.m_DataMutex);
  agent.m_TVXHBA_RegisteredProfile_map.clear();
  agent.m_TVXHBA_PCIDevice_map.clear();
  auto& adapter = dynamic_cast<FCAdapter&>(*agent.m_pData->m_Adapters[0]);
  auto& port = dynamic_cast<FCPort&>(*adapter.getPort(0));
  Host_Build host{agent};
  host.system = agent.m_CIM_ComputerSystem_map[0];
  Adapter_Build adapterBuild{host, adapter,
                             dynamic_cast<const FCAdapterAttributes&>(*adapter.getAttributes())};
  Port_Build portBuild{adapterBuild, port,
                       dynamic_cast<const FCPortAttributes&>(*port.getAttributes())};
  EXPECT_EQ(CreatePCIDeviceInstance(portBuild), MAP_BUILD_LEAVE_PORT);
  EXPECT_EQ(log.level("Failed to create TVXHBA_PCIElementConformsToProfile"), TVX_CRIT);
  EXPECT_EQ(log.count("CreatePCIDeviceInstance failed"), 0u);
  // The device is there now: a second one of the same key is a failure of the build.
  EXPECT_EQ(CreatePCIDeviceInstance(portBuild), MAP_BUILD_FAILED);
  EXPECT_EQ(log.level("Insert Failed : m_TVXHBA_PCIDevice_map"), TVX_CRIT);
  EXPECT_EQ(log.count("CreatePCIDeviceInstance failed"), 1u);
}

}  // namespace
}  // namespace cimrt::test
