// What the libraries tell of the adapters and ports of the default scenario.
#include "sim/Libraries.h"

namespace tvx::sim_test {
namespace {

using Identity = Simulated_Host;

std::string adapter_name(const Library& hba, HBA_UINT32 index) {
  char name[256] = "";
  EXPECT_EQ(SIM_CALL(hba, HBA_GetAdapterName, index, name), HBA_STATUS_OK + 0u);
  return name;
}

TEST_F(Identity, EachPortIsAnAdapterAndTheConvergedCardIsShownToo) {
  EXPECT_EQ(SIM_CALL(hba, HBA_LoadLibrary), 0u);
  EXPECT_EQ(hba.entry<HBA_UINT32()>("HBA_GetVersion")(), 2u);
  ASSERT_EQ(SIM_CALL(hba, HBA_GetNumberOfAdapters), 5u);
  EXPECT_EQ(adapter_name(hba, 0), "Torvex-TVX16002-1");
  EXPECT_EQ(adapter_name(hba, 1), "Torvex-TVX16002-2");
  EXPECT_EQ(adapter_name(hba, 2), "Torvex-TVX8102-3");
  EXPECT_EQ(adapter_name(hba, 3), "Torvex-TVX8102-4");
  EXPECT_EQ(adapter_name(hba, 4), "Torvex-OCN11102-5");
}

TEST_F(Identity, AnIndexPastTheLastAdapterIsRefused) {
  char name[256];
  EXPECT_EQ(SIM_CALL(hba, HBA_GetAdapterName, 5u, name), HBA_STATUS_ERROR_ILLEGAL_INDEX + 0u);
}

TEST_F(Identity, AdapterAttributesDescribeTheCard) {
  const HBA_HANDLE handle = open("Torvex-TVX16002-2");
  ASSERT_NE(handle, 0u);
  HBA_ADAPTERATTRIBUTES attributes{};
  ASSERT_EQ(SIM_CALL(hba, HBA_GetAdapterAttributes, handle, &attributes), 0u);
  EXPECT_STREQ(attributes.Manufacturer, "Torvex Corporation");
  EXPECT_STREQ(attributes.SerialNumber, "TX52100417");
  EXPECT_STREQ(attributes.Model, "TVX16002");
  EXPECT_STREQ(attributes.FirmwareVersion, "2.01a4");
  EXPECT_STREQ(attributes.OptionROMVersion, "5.30a2");
  EXPECT_STREQ(attributes.DriverVersion, "5.2.18.4");
  EXPECT_STREQ(attributes.DriverName, "tvxfc");
  EXPECT_EQ(attributes.NumberOfPorts, 1u);
  EXPECT_EQ(number(attributes.NodeWWN), 0x20000254560C4111ULL);
}

TEST_F(Identity, PortAttributesDescribeTheLink) {
  const HBA_HANDLE handle = open("Torvex-TVX16002-1");
  HBA_PORTATTRIBUTES attributes{};
  ASSERT_EQ(SIM_CALL(hba, HBA_GetAdapterPortAttributes, handle, 0u, &attributes), 0u);
  EXPECT_EQ(number(attributes.PortWWN), 0x10000254560C4110ULL);
  EXPECT_EQ(number(attributes.NodeWWN), 0x20000254560C4110ULL);
  EXPECT_EQ(number(attributes.FabricName), 0x100000054D5A8001ULL);
  EXPECT_EQ(attributes.PortFcId, 0x010400u);
  EXPECT_EQ(attributes.PortType, HBA_PORTTYPE_NPORT + 0u);
  EXPECT_EQ(attributes.PortState, HBA_PORTSTATE_ONLINE + 0u);
  EXPECT_EQ(attributes.PortSpeed, 32u);
  EXPECT_EQ(attributes.PortMaxFrameSize, 2048u);
  EXPECT_EQ(attributes.PortSupportedFc4Types.bits[2], 1);
  EXPECT_STREQ(attributes.OSDeviceName, "/sys/class/scsi_host/host0");
  EXPECT_STRNE(attributes.PortSymbolicName, "");
  EXPECT_EQ(SIM_CALL(hba, HBA_GetAdapterPortAttributes, handle, 1u, &attributes),
            HBA_STATUS_ERROR_ILLEGAL_INDEX + 0u);
}

TEST_F(Identity, HandlesLiveFromOpenToClose) {
  const unsigned before = tvxsim_open_handles();
  const HBA_HANDLE handle = open("Torvex-TVX16002-1");
  EXPECT_EQ(tvxsim_open_handles(), before + 1);
  SIM_CALL(hba, HBA_RefreshInformation, handle);
  SIM_CALL(hba, HBA_CloseAdapter, handle);
  EXPECT_EQ(tvxsim_open_handles(), before);
  HBA_ADAPTERATTRIBUTES attributes;
  EXPECT_EQ(SIM_CALL(hba, HBA_GetAdapterAttributes, handle, &attributes),
            HBA_STATUS_ERROR_INVALID_HANDLE + 0u);
  EXPECT_EQ(open("Torvex-NoSuch-1"), 0u);
}

TEST_F(Identity, EveryAdapterAttributeOfTheInterfaceIsReported) {
  ASSERT_EQ(SIM_CALL(rm, LRM_InitLib), 0);
  Block block(rm, 2048);
  ASSERT_EQ(
      SIM_CALL(rm, LRM_GetHBAAttributes, wwn(0x10000254560A7E20ULL), block.data(), &block.size), 0);
  EXPECT_EQ(block.u32(RM_HA_DEVICE_ID), 0xE200u);
  EXPECT_EQ(block.u32(RM_HA_MODEL_ID), 0xE208u);
  EXPECT_EQ(block.u32(RM_HA_BOARD_TEMPERATURE), 0x004B5533u);
  EXPECT_EQ(block.u32(RM_HA_SLI_MODE), 3u);
  EXPECT_EQ(block.u32(RM_HA_FUNCTION_TYPE), 0u);
  EXPECT_EQ(block.u32(RM_HA_PCI_BUS_NUMBER), 65u);
  EXPECT_EQ(block.u32(RM_HA_PCI_FUNCTION_NUMBER), 0u);
  EXPECT_EQ(block.u32(RM_HA_PORT_NUMBER), 0u);
  EXPECT_EQ(block.u32(RM_HA_BOOT_CODE_ENABLED), 0u);
  EXPECT_EQ(block.length(RM_HA_IEEE_ADDRESS), 6u);
  EXPECT_EQ(block.text(RM_HA_SUBADAPTER_ID), "1");
  EXPECT_EQ(block.text(RM_HA_FIRMWARE_ON_FLASH), "1.12a7");
  for (const std::uint32_t id :
       {RM_HA_NODE_SYMBOLIC_NAME, RM_HA_OPTION_ROM_VERSION, RM_HA_OPERATIONAL_FIRMWARE,
        RM_HA_SLI1_FIRMWARE_NAME, RM_HA_SLI2_FIRMWARE_NAME, RM_HA_BOOT_BIOS_VERSION,
        RM_HA_DIAG_VERSION, RM_HA_INITIAL_FW_LOAD, RM_HA_KERNEL_VERSION, RM_HA_SLI3_FIRMWARE_NAME,
        RM_HA_SP_FIRMWARE_VERSION, RM_HA_SP_FIRMWARE_NAME, RM_HA_ULP_FIRMWARE_VERSION,
        RM_HA_ULP_FIRMWARE_NAME, RM_HA_FC_UNIVERSAL_VERSION, RM_HA_FC_X86_BIOS_VERSION,
        RM_HA_FC_EFI_VERSION, RM_HA_FC_FCODE_VERSION}) {
    EXPECT_TRUE(block.has(id)) << std::hex << id;
  }
  EXPECT_FALSE(block.has(0x999));
}

TEST_F(Identity, PortAttributesOfTheManagementLibrary) {
  Block block(rm, 2048);
  ASSERT_EQ(SIM_CALL(rm, LRM_GetPortAttributes, first_port, block.data(), &block.size), 0);
  EXPECT_EQ(block.u32(RM_PA_PORT_TYPE), 5u);
  EXPECT_EQ(block.u32(RM_PA_PORT_STATE), 2u);
  EXPECT_EQ(block.u32(RM_PA_FEC_STATE), 1u);
  EXPECT_EQ(block.length(RM_PA_FABRIC_NAME), 8u);
}

TEST_F(Identity, ABlockThatDoesNotFitTellsTheRoomNeededAndIsNotTouched) {
  Block block(rm, 64);
  EXPECT_EQ(SIM_CALL(rm, LRM_GetHBAAttributes, first_port, block.data(), &block.size),
            RM_ERROR_MORE_DATA);
  EXPECT_GT(block.size, 64u);
  EXPECT_FALSE(block.has(RM_HA_DEVICE_ID));
}

TEST_F(Identity, OnlyLocalPortsAreLocal) {
  std::uint32_t local = 7;
  EXPECT_EQ(SIM_CALL(rm, RM_IsLocalHBA, first_port, &local), 0);
  EXPECT_EQ(local, 1u);
  EXPECT_EQ(SIM_CALL(rm, RM_IsLocalHBA, wwn(0x50060160ABCDULL), &local), 0);
  EXPECT_EQ(local, 0u);
  Block block(rm);
  EXPECT_EQ(SIM_CALL(rm, LRM_GetHBAAttributes, wwn(1), block.data(), &block.size),
            RM_ERROR_INVALID_WWN);
}

TEST_F(Identity, DriverTypeVersionsAndStatusTexts) {
  std::uint32_t type = 0;
  EXPECT_EQ(SIM_CALL(rm, LRM_GetDriverType, first_port, &type), 0);
  EXPECT_EQ(type, 5u);
  char text[64] = "";
  EXPECT_EQ(SIM_CALL(rm, RM_MiliVersion, text, 64u), 0);
  EXPECT_STREQ(text, "5.2.18.4");
  EXPECT_EQ(SIM_CALL(rm, RM_MiliVersion, text, 4u), RM_ERROR_VERSION_TOO_SMALL);
  std::uint32_t size = 4;
  EXPECT_EQ(SIM_CALL(rm, RM_GetVersion, 0x66, text, &size), RM_ERROR_VERSION_TOO_SMALL);
  EXPECT_EQ(size, 9u);
  EXPECT_EQ(SIM_CALL(rm, RM_GetVersion, 0x66, text, &size), 0);
  EXPECT_STREQ(text, "5.2.18.4");
  EXPECT_NE(SIM_CALL(rm, RM_GetVersion, 3, text, &size), 0);
  EXPECT_EQ(SIM_CALL(rm, RM_StatusString, 148, text, 64u), 0);
  EXPECT_STREQ(text, "Mailbox command failed");
  EXPECT_EQ(SIM_CALL(rm, RM_StatusString, 12345, text, 64u), 0);
  EXPECT_STREQ(text, "");
}

TEST_F(Identity, LocalPortsAreCountedAndFoundByIndex) {
  EXPECT_EQ(SIM_CALL(rm, RM_GetNumberOfLocalAdapters), 5u);
  RM_LocalHBASelector selector{0, 3};
  RM_LocalHBAInfo info{};
  EXPECT_EQ(SIM_CALL(rm, RM_GetLocalHBAInfo, &selector, &info), 0);
  EXPECT_EQ(number(info.wwpn), 0x10000254560A7E21ULL);
  selector.index = 5;
  EXPECT_NE(SIM_CALL(rm, RM_GetLocalHBAInfo, &selector, &info), 0);
}

TEST_F(Identity, NamesOfKnownFormatsAreValid) {
  EXPECT_EQ(SIM_CALL(rm, RM_ValidateWwn, first_port), 0);
  EXPECT_EQ(SIM_CALL(rm, RM_ValidateWwn, wwn(0)), RM_ERROR_INVALID_WWN);
  EXPECT_EQ(SIM_CALL(rm, RM_ValidateWwn, wwn(0xF000000000000001ULL)), RM_ERROR_INVALID_WWN);
}

}  // namespace
}  // namespace tvx::sim_test
