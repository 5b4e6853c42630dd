// What discovery reads of each adapter and port, field by field.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cstring>
#include <string>

#include "Discovery_Fixture.h"

namespace cimrt {
namespace {

using testing::ElementsAre;
using tvx::test::Fake_Adapter;
using tvx::test::rawBytes;

// ---- Attributes of an adapter ----

TEST_F(Discovery, TakesTheSniaFields) {
  Fake_Adapter& adapter = host.add("Torvex-A0", 1);
  std::strcpy(adapter.snia.Manufacturer, "Torvex");
  std::strcpy(adapter.snia.SerialNumber, "SN1");
  std::strcpy(adapter.snia.Model, "TVX16002");
  std::strcpy(adapter.snia.ModelDescription, "description");
  std::strcpy(adapter.snia.NodeSymbolicName, "from the other library");
  std::strcpy(adapter.snia.HardwareVersion, "hw");
  std::strcpy(adapter.snia.DriverVersion, "drv");
  std::strcpy(adapter.snia.OptionROMVersion, "from the other library");
  std::strcpy(adapter.snia.FirmwareVersion, "fw");
  std::strcpy(adapter.snia.DriverName, "tvfc");
  adapter.snia.VendorSpecificID = 0xE300;
  const FCAdapterAttributes& a = attributes();
  EXPECT_EQ(a.Manufacturer, "Torvex");
  EXPECT_EQ(a.SerialNumber, "SN1");
  EXPECT_EQ(a.Model, "TVX16002");
  EXPECT_EQ(a.ModelDescription, "description");
  EXPECT_EQ(a.NodeSymbolicName, "");
  EXPECT_EQ(a.HardwareVersion, "hw");
  EXPECT_EQ(a.DriverVersion, "drv");
  EXPECT_EQ(a.OptionROMVersion, "");
  EXPECT_EQ(a.FirmwareVersion, "fw");
  EXPECT_EQ(a.DriverName, "tvfc");
  EXPECT_EQ(a.NodeWWN, "2000000000000000");
  EXPECT_EQ(a.PortWWN, "1000000000000000");
  EXPECT_EQ(a.VendorSpecificID, 0xE300U);
  EXPECT_EQ(a.NumberOfPorts, 1U);
  EXPECT_TRUE(capture.has(TVX_DBG, "_NodeSymbolicName="));
}

TEST_F(Discovery, FieldsWithoutAnEndAreBounded) {
  Fake_Adapter& adapter = host.add("Torvex-A0", 1);
  std::memset(adapter.snia.Manufacturer, 'm', sizeof adapter.snia.Manufacturer);
  EXPECT_EQ(attributes().Manufacturer, std::string(64, 'm'));
}

TEST_F(Discovery, StaleAdapterDataAreReadOnceMore) {
  Fake_Adapter& adapter = host.add("Torvex-A0", 1);
  std::strcpy(adapter.snia.Model, "fresh");
  adapter.statuses = {8};
  EXPECT_EQ(attributes().Model, "fresh");
  EXPECT_EQ(host.refreshed, 1);
}

TEST_F(Discovery, AFailedAdapterReadGoesOnWithoutSniaFields) {
  for (const std::vector<HBA_STATUS>& statuses : {std::vector<HBA_STATUS>{3}, {8, 8}, {8, 3}}) {
    host.adapters.clear();
    Fake_Adapter& adapter = host.add("Torvex-A0", 2);
    std::strcpy(adapter.snia.Model, "model");
    adapter.attributes[0x20E] = rawBytes(std::uint32_t{0xE300});
    adapter.statuses = statuses;
    const FCAdapterAttributes& a = attributes();
    EXPECT_TRUE(capture.has(TVX_ERR, "Error hbaStatus=" + std::to_string(statuses.back()) +
                                         ", skipping Adapter Torvex-A0"));
    EXPECT_EQ(a.Model, "");
    EXPECT_EQ(a.NumberOfPorts, 0U);
    EXPECT_EQ(a.DeviceID, 0xE300U);
    EXPECT_EQ(data.m_Adapters[0]->getNumberOfPorts(), 0U);
    EXPECT_EQ(data.m_AdapterCount, 1U);
  }
}

TEST_F(Discovery, ReadsTheNumberKeys) {
  struct {
    std::uint32_t key;
    const char* label;
    std::uint32_t FCAdapterAttributes::*field;
  } const keys[] = {{0x20E, "_DeviceID", &FCAdapterAttributes::DeviceID},
                    {0x20F, "_ModelID", &FCAdapterAttributes::ModelID},
                    {0x220, "_DiagVersion", &FCAdapterAttributes::DiagVersion},
                    {0x22C, "_FunctionType", &FCAdapterAttributes::FunctionType},
                    {0x229, "_PortNumber", &FCAdapterAttributes::PortNumber},
                    {0x225, "_SLIMode", &FCAdapterAttributes::SLIMode},
                    {0x230, "_PCIFunctionNumber", &FCAdapterAttributes::PCIFunctionNumber},
                    {0x22B, "_PCIBusNumber", &FCAdapterAttributes::PCIBusNumber}};
  Fake_Adapter& adapter = host.add("Torvex-A0", 1);
  for (const auto& key : keys) adapter.attributes[key.key] = rawBytes(key.key + 1000);
  const FCAdapterAttributes& a = attributes();
  for (const auto& key : keys) {
    EXPECT_EQ(a.*key.field, key.key + 1000) << key.label;
    EXPECT_TRUE(capture.has(
        TVX_DBG, std::string(key.label) + ": [ " + std::to_string(key.key + 1000) + " ]"));
  }
}

TEST_F(Discovery, ReadsTheTextKeys) {
  struct {
    std::uint32_t key;
    const char* label;
    std::string FCAdapterAttributes::*field;
  } const keys[] = {{0x216, "_BOOTBIOS_VERSION", &FCAdapterAttributes::BootBIOSVersion},
                    {0x222, "_KERNEL_VERSION", &FCAdapterAttributes::KernelVersion},
                    {0x221, "INITIAL_FW_LOAD", &FCAdapterAttributes::InitialFirmwareLoad},
                    {0x210, "Operational Firmware", &FCAdapterAttributes::OperationalFirmware},
                    {0x24F, "_FirmwareOnFlash", &FCAdapterAttributes::FirmwareOnFlash},
                    {0x24B, "_FCUniversalVersion", &FCAdapterAttributes::FCUniversalVersion},
                    {0x24C, "FC_X86_BIOSVersion", &FCAdapterAttributes::FCX86BIOSVersion},
                    {0x24D, "_FC_EFIVersion", &FCAdapterAttributes::FCEFIVersion},
                    {0x24E, "_FC_FCODEVersion", &FCAdapterAttributes::FCFCodeVersion},
                    {0x235, "_ULPFirmwareVersion", &FCAdapterAttributes::ULPFirmwareVersion},
                    {0x236, "_ULPFirmwareName", &FCAdapterAttributes::ULPFirmwareName},
                    {0x233, "_SPFirmwareVersion", &FCAdapterAttributes::SPFirmwareVersion},
                    {0x234, "_SPFirmwareName", &FCAdapterAttributes::SPFirmwareName},
                    {0x211, "_SLI1FirmwareName", &FCAdapterAttributes::SLI1FirmwareName},
                    {0x212, "_SLI2FirmwareName", &FCAdapterAttributes::SLI2FirmwareName},
                    {0x224, "_SLI3FirmwareName", &FCAdapterAttributes::SLI3FirmwareName},
                    {0x209, "_OptionROMVersion", &FCAdapterAttributes::OptionROMVersion},
                    {0x207, "_NodeSymbolicName", &FCAdapterAttributes::NodeSymbolicName},
                    {0x24A, "_SubadapterID", &FCAdapterAttributes::SubAdapterID}};
  Fake_Adapter& adapter = host.add("Torvex-A0", 1);
  for (const auto& key : keys) adapter.attributes[key.key] = std::string("v") + key.label;
  const FCAdapterAttributes& a = attributes();
  for (const auto& key : keys) {
    EXPECT_EQ(a.*key.field, std::string("v") + key.label);
    EXPECT_TRUE(capture.has(TVX_DBG, std::string(key.label) + " : [ v" + key.label + " ]"));
  }
}

TEST_F(Discovery, KeysAreReadInOrder) {
  host.add("Torvex-A0", 1);
  build();
  std::vector<std::string> labels;
  for (const std::string& text : capture.texts()) {
    if (text.find("call failed (44)") == std::string::npos) continue;
    const bool isNumber = text.find(" HA_") != std::string::npos;
    const std::size_t from = isNumber ? text.find(" HA_") + 4 : std::strlen("ERROR: ");
    const std::size_t to = text.find(isNumber ? " call" : ": RM", from);
    labels.push_back(text.substr(from, to - from));
  }
  EXPECT_THAT(labels, ElementsAre("_BoardTemperature", "_DeviceID", "_ModelID", "_DiagVersion",
                                  "_FunctionType", "_IEEE_ADDRESS", "_BOOTBIOS_VERSION",
                                  "_KERNEL_VERSION", "INITIAL_FW_LOAD", "Operational Firmware",
                                  "_FirmwareOnFlash", "_BootCodeEnabled", "_PortNumber", "_SLIMode",
                                  "_FCUniversalVersion", "FC_X86_BIOSVersion", "_FC_EFIVersion",
                                  "_FC_FCODEVersion", "_ULPFirmwareVersion", "_ULPFirmwareName",
                                  "_SPFirmwareVersion", "_SPFirmwareName", "_PCIFunctionNumber",
                                  "_PCIBusNumber", "_SLI1FirmwareName", "_SLI2FirmwareName",
                                  "_SLI3FirmwareName", "_OptionROMVersion", "_NodeSymbolicName",
                                  "_SubadapterID", "_PortState", "_FECState"));
}

TEST_F(Discovery, AMissingKeyKeepsTheStartingValue) {
  host.add("Torvex-A0", 1);
  const FCAdapterAttributes& a = attributes();
  EXPECT_EQ(a.DeviceID, 0U);
  EXPECT_EQ(a.BoardTemperature + a.ThresholdCriticalTemp + a.ThresholdWarningTemp, 0U);
  EXPECT_EQ(a.KernelVersion, "");
  EXPECT_EQ(a.IEEEAddress, "");
  EXPECT_FALSE(a.BootCodeEnabled);
  EXPECT_TRUE(capture.has(TVX_DBG, "ERROR: RM_GetHBAAttributeValue HA__DeviceID call failed (44)"));
  EXPECT_TRUE(capture.has(TVX_DBG, "ERROR: _KERNEL_VERSION: RM_GetHBAAttributes call failed (44)"));
  EXPECT_TRUE(capture.has(TVX_DBG, "ERROR: _IEEE_ADDRESS: RM_GetHBAAttributes call failed (44)"));
}

TEST_F(Discovery, SplitsTheBoardTemperature) {
  host.add("Torvex-A0", 1).attributes[0x227] = rawBytes(std::uint32_t{0x00463C2A});
  const FCAdapterAttributes& a = attributes();
  EXPECT_EQ(a.BoardTemperature, 42U);
  EXPECT_EQ(a.ThresholdCriticalTemp, 60U);
  EXPECT_EQ(a.ThresholdWarningTemp, 70U);
}

TEST_F(Discovery, FormatsTheHardwareAddress) {
  Fake_Adapter& adapter = host.add("Torvex-A0", 1);
  adapter.attributes[0x213] = std::string("\x00\x02\xAB\xcd\x0E\xF0", 6);
  EXPECT_EQ(attributes().IEEEAddress, "00:02:ab:cd:0e:f0");
  EXPECT_TRUE(capture.has(TVX_DBG, "_IEEE_ADDRESS : [ 00:02:ab:cd:0e:f0 ]"));
  host.adapters[0].attributes[0x213] = "short";
  EXPECT_EQ(attributes().IEEEAddress, "");
}

TEST_F(Discovery, BootCodeIsEnabledWhenItReadsAndIsNotZero) {
  host.add("Torvex-A0", 1).attributes[0x214] = rawBytes(std::uint32_t{2});
  EXPECT_TRUE(attributes().BootCodeEnabled);
  host.adapters[0].attributes[0x214] = rawBytes(std::uint32_t{0});
  EXPECT_FALSE(attributes().BootCodeEnabled);
}

TEST_F(Discovery, ReadsTheDriverTypeBetweenItsNeighbours) {
  Fake_Adapter& adapter = host.add("Torvex-A0", 1);
  adapter.driverType = 5;
  adapter.attributes[0x220] = rawBytes(std::uint32_t{1});
  adapter.attributes[0x22C] = rawBytes(std::uint32_t{0});
  EXPECT_EQ(attributes().DriverType, 5U);
  EXPECT_EQ(capture.position("_DriverType: [ 5 ]"), capture.position("_DiagVersion: [ 1 ]") + 1);
  EXPECT_EQ(capture.position("_FunctionType: [ 0 ]"), capture.position("_DriverType: [ 5 ]") + 1);
}

TEST_F(Discovery, AFailedDriverTypeIsLoggedAndPassedOver) {
  Fake_Adapter& adapter = host.add("Torvex-A0", 1);
  adapter.driverType = 5;
  adapter.driverTypeStatus = 2;
  EXPECT_EQ(attributes().DriverType, 0U);
  EXPECT_TRUE(capture.has(TVX_ERR, "ERROR: RM_GetDriverType call failed (2)"));
}

// ---- Ports ----

TEST_F(Discovery, TakesThePortFields) {
  HBA_PORTATTRIBUTES& snia = host.add("Torvex-A0", 1).ports[0].snia;
  snia.PortFcId = 0x010400;
  snia.PortType = 5;
  snia.PortState = 2;
  snia.PortSupportedClassofService = 8;
  snia.PortSupportedFc4Types.bits[2] = 0x81;
  snia.PortActiveFc4Types.bits[31] = 0xFF;
  std::strcpy(snia.PortSymbolicName, "symbolic");
  std::strcpy(snia.OSDeviceName, "/sys/x");
  snia.PortSupportedSpeed = 0x1A;
  snia.PortSpeed = 16;
  snia.PortMaxFrameSize = 2048;
  snia.FabricName = tvx::test::wwnOf(0x30, 0xAB);
  snia.NumberofDiscoveredPorts = 7;
  const FCPortAttributes& p = portAttributes();
  EXPECT_EQ(p.PortFcId, 0x010400U);
  EXPECT_EQ(p.PortType, 5U);
  EXPECT_EQ(p.PortState, 2U);
  EXPECT_EQ(p.PortSupportedClassofService, 8U);
  EXPECT_EQ(p.PortSupportedFc4Types[2], 0x81U);
  EXPECT_EQ(p.PortActiveFc4Types[31], 0xFFU);
  EXPECT_EQ(p.PortActiveFc4Types[2], 0U);
  EXPECT_EQ(p.PortSymbolicName, "symbolic");
  EXPECT_EQ(p.OSDeviceName, "/sys/x");
  EXPECT_EQ(p.PortSupportedSpeed, 0x1AU);
  EXPECT_EQ(p.PortSpeed, 16U);
  EXPECT_EQ(p.PortMaxFrameSize, 2048U);
  EXPECT_EQ(p.PortWWN, "1000000000000000");
  EXPECT_EQ(p.NodeWWN, "2000000000000000");
  EXPECT_EQ(p.FabricName, "30000000000000AB");
  EXPECT_EQ(p.NumberofDiscoveredPorts, 7U);
  EXPECT_EQ(p.FECState, 2U);
}

TEST_F(Discovery, ThePhysicalStateOverwritesThePortState) {
  auto& port = host.add("Torvex-A0", 1).ports[0];
  port.snia.PortState = 2;
  port.attributes[0x306] = rawBytes(std::uint32_t{22});
  port.attributes[0x360] = rawBytes(std::uint32_t{1});
  const FCPortAttributes& p = portAttributes();
  EXPECT_EQ(p.PortState, 22U);
  EXPECT_EQ(p.FECState, 1U);
  EXPECT_TRUE(capture.has(TVX_DBG, "Physical port state for FC Port: 22"));
  EXPECT_TRUE(capture.has(TVX_DBG, "FEC state for FC Port: 1"));
}

TEST_F(Discovery, AMissingPortKeyKeepsTheValue) {
  host.add("Torvex-A0", 1).ports[0].snia.PortState = 3;
  EXPECT_EQ(portAttributes().PortState, 3U);
  EXPECT_TRUE(capture.has(TVX_DBG, "ERROR: RM_GetPortAttributes HA__PortState call failed (44)"));
  EXPECT_TRUE(capture.has(TVX_DBG, "ERROR: RM_GetPortAttributes HA__FECState call failed (44)"));
}

TEST_F(Discovery, StalePortDataAreReadOnceMore) {
  // The first reading of port 0 belongs to the adapter, the second to the port.
  host.add("Torvex-A0", 1).ports[0].statuses = {8, 0, 8, 0};
  build();
  EXPECT_TRUE(capture.has(TVX_DBG, "FCPort::FCPort"));
  EXPECT_EQ(data.m_Ports.size(), 1U);
  EXPECT_EQ(host.refreshed, 2);
}

TEST_F(Discovery, APortThatFailsLeavesAGap) {
  Fake_Adapter& adapter = host.add("Torvex-A0", 3);
  adapter.ports[1].statuses = {12};
  build();
  EXPECT_TRUE(capture.has(TVX_ERR, "(portIndex=1) failed with hbaStatus 12"));
  EXPECT_TRUE(
      capture.has(TVX_ERR, "Failed to fetch information for port: [1] on adapter: [Torvex-A0]"));
  ASSERT_EQ(data.m_Adapters.size(), 1U);
  Adapter& kept = *data.m_Adapters[0];
  EXPECT_EQ(kept.getNumberOfPorts(), 2U);
  EXPECT_EQ(kept.getPort(1)->m_Index, 2U);
  EXPECT_EQ(kept.getPort(1)->m_Name, "1000000000000002");
  EXPECT_EQ(data.m_Ports.size(), 2U);
}

TEST_F(Discovery, APortIsClosedBeforeItsFailureIsTold) {
  host.add("Torvex-A0", 2).ports[1].statuses = {12};
  host.libraries.provide(HBA_CloseAdapter, [this](HBA_HANDLE) {
    --host.open;
    TVX_LOG(TVX_DBG, "closed, %d open", host.open);
  });
  build();
  const std::size_t failure = capture.position("(portIndex=1) failed with hbaStatus 12");
  ASSERT_LT(failure, capture.lines().size());
  EXPECT_EQ(capture.lines()[failure - 1].text, "closed, 0 open");
  EXPECT_EQ(capture.count(TVX_DBG, "closed, 0 open"), 3U);  // the adapter, port 0, port 1
}

TEST_F(Discovery, APort0FailureIsToldBeforeTheAdapterIsClosed) {
  host.add("Torvex-A0", 1).ports[0].statuses = {12};
  host.libraries.provide(HBA_CloseAdapter, [this](HBA_HANDLE) {
    --host.open;
    TVX_LOG(TVX_DBG, "closed");
  });
  build();
  EXPECT_EQ(capture.position("closed"),
            capture.position("(portIndex = 0) failed with hbaStatus 12") + 1);
}

TEST_F(Discovery, APortStaleTwiceFails) {
  host.add("Torvex-A0", 2).ports[1].statuses = {8, 8};
  build();
  EXPECT_TRUE(capture.has(TVX_ERR, "(portIndex=1) failed with hbaStatus 8"));
  EXPECT_EQ(data.m_Ports.size(), 1U);
}

TEST_F(Discovery, APortWithoutAttributeBlockFails) {
  host.add("Torvex-A0", 2).ports[1].attributesStatus = 21;
  build();
  EXPECT_TRUE(capture.has(TVX_ERR, "RM_GetPortAttributes call failed (21)\n"));
  EXPECT_TRUE(
      capture.has(TVX_ERR, "Failed to fetch information for port: [1] on adapter: [Torvex-A0]"));
  EXPECT_EQ(data.m_Ports.size(), 1U);
}

TEST_F(Discovery, AnAdapterThatClosesBetweenItsPortsKeepsTheFirst) {
  host.add("Torvex-A0", 2);
  int opens = 0;
  host.libraries.provide(HBA_OpenAdapter, [&](char*) -> HBA_HANDLE {
    if (++opens == 3) return 0;  // the adapter, port 0, port 1
    ++host.open;
    return 1;
  });
  build();
  EXPECT_TRUE(capture.has(TVX_ERR, "HBA_OpenAdapter failed, skipping Adapter Torvex-A0"));
  EXPECT_EQ(data.m_Ports.size(), 1U);
}

}  // namespace
}  // namespace cimrt
