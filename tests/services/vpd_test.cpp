// Vital product data of a port, and of field replaceable units.
#include <cstdlib>
#include <new>

#include "../agent/Agent_Fixture.h"
#include "../agent/Instance_Checks.h"
#include "access/TVX_VpdReader.h"
#include "agent/Map_Insert.h"
#include "agent/ProductSteps.h"
#include "agent/SoftwareIdentities.h"
#include "common/TVX_Memory.h"
#include "services/TVX_Vpd.h"

namespace cimrt::test {
namespace {

constexpr const char* PORT = "1000000000000001";

class Vpd_Test : public Agent_Test {
 protected:
  /// One card SN1 whose port has these members more.
  ProviderAgent& build(const std::string& more, const std::string& card = {}) {
    return builtAgent(R"({"cards": [{"model": "TVX1", "serial_number": "SN1", )" + card +
                      R"("ports": [{"wwpn": "10:00:00:00:00:00:00:01")" + more + "}]}]}");
  }
};

// --- The port's data -------------------------------------------------------------------------

class Port_Vpd : public Vpd_Test {
 protected:
  static constexpr const char* ALL =
      R"(, "vpd": [{"product_name": true, "value": "The product"},
        {"keyword": "CP", "value": "cap"}, {"keyword": "EC", "value": "A-1"},
        {"keyword": "FG", "value": "fabric"}, {"keyword": "LC", "value": "slot 3"},
        {"keyword": "MN", "value": "1E77"}, {"keyword": "PG", "value": "pci"},
        {"keyword": "PN", "value": "P100"}, {"keyword": "SN", "value": "S200"},
        {"keyword": "YX", "value": "w"}, {"keyword": "V0", "value": "f0"},
        {"keyword": "V1", "value": "f1"}, {"keyword": "V2", "value": "f2"},
        {"keyword": "V3", "value": "f3"}, {"keyword": "V4", "value": "f4"},
        {"keyword": "V5", "value": "f5"}, {"keyword": "VB", "value": "fb"},
        {"keyword": "V6", "value": "six"}, {"keyword": "ZZ", "value": "last"}])";
};

TEST_F(Port_Vpd, EveryKeywordGoesToItsProperty) {
  ProviderAgent& agent = build(ALL);
  ASSERT_EQ(agent.m_TVXHBA_VitalProductData_map.size(), 1u);
  const TVXHBA_VitalProductData& vpd = *agent.m_TVXHBA_VitalProductData_map[0];
  EXPECT_TRUE(vpd.__name_space == "root/torvex");
  EXPECT_EQ(textOf(vpd.InstanceID), PORT);
  EXPECT_EQ(textOf(vpd.ProductName), "The product");
  EXPECT_EQ(textOf(vpd.ExtCapability), "cap");
  EXPECT_EQ(textOf(vpd.ECLevel), "A-1");
  EXPECT_EQ(textOf(vpd.FabricGeography), "fabric");
  EXPECT_EQ(textOf(vpd.Location), "slot 3");
  EXPECT_EQ(textOf(vpd.ManufactureId), "1E77");
  EXPECT_EQ(textOf(vpd.PCIGeography), "pci");
  EXPECT_EQ(textOf(vpd.PartNumber), "P100");
  EXPECT_EQ(textOf(vpd.VPDSerialNumber), "S200");
  EXPECT_EQ(textOf(vpd.VPDW), "w");
  EXPECT_EQ(textOf(vpd.FieldV0), "f0");
  EXPECT_EQ(textOf(vpd.FieldV1), "f1");
  EXPECT_EQ(textOf(vpd.FieldV2), "f2");
  EXPECT_EQ(textOf(vpd.FieldV3), "f3");
  EXPECT_EQ(textOf(vpd.FieldV4), "f4");
  EXPECT_EQ(textOf(vpd.FieldV5), "f5");
  EXPECT_EQ(textOf(vpd.FieldVB), "fb");
  EXPECT_EQ(textsOf(vpd.VPDTags), (std::vector<std::string>{"V6", "ZZ"}));
  EXPECT_EQ(textsOf(vpd.VPDTagValues), (std::vector<std::string>{"six", "last"}));
}

TEST_F(Port_Vpd, KeywordsAreLogged) {
  build(ALL);
  EXPECT_EQ(log.count("Inside CreateVPD"), 1u);
  for (const char* text :
       {"VPD:EXT_CAPABILITY", "VPD:EC_LEVEL", "VPD:FABRIC_GEOGRAPHY", "VPD:LOCATION",
        "VPD:MANUFACTURER_ID", "VPD:PCI_GEOGRAPHY", "VPD:PART_NUMBER", "VPD:SERIAL_NUMBER",
        "VPD:YX (VPD-W)", "V6--six", "ZZ--last"})
    EXPECT_EQ(log.count(text), 1u) << text;
}

TEST_F(Port_Vpd, WithoutOtherKeywordsTheArraysStayNull) {
  ProviderAgent& agent = build(R"(, "vpd": [{"keyword": "V0", "value": "x"}])");
  const TVXHBA_VitalProductData& vpd = *agent.m_TVXHBA_VitalProductData_map[0];
  EXPECT_TRUE(vpd.VPDTags.is_null());
  EXPECT_TRUE(vpd.VPDTagValues.is_null());
  EXPECT_TRUE(vpd.ProductName.is_null());
}

TEST_F(Port_Vpd, TiesThePciDevice) {
  ProviderAgent& agent = build(ALL);
  ASSERT_EQ(agent.m_TVXHBA_ElementVPD_map.size(), 1u);
  EXPECT_TRUE(tiesClones(agent.m_TVXHBA_ElementVPD_map[0], agent.m_TVXHBA_PCIDevice_map[0],
                         agent.m_TVXHBA_VitalProductData_map[0]));
}

TEST_F(Port_Vpd, FailedReadLeavesThePortWithoutThem) {
  useScenario(R"({"cards": [{"ports": [{"wwpn": "10:00:00:00:00:00:00:01"}]}],
      "faults": [{"call": "LRM_GetVPD", "status": 9}]})");
  ProviderAgent& agent = startAgent();
  refresh(agent);
  EXPECT_EQ(agent.m_TVXHBA_VitalProductData_map.size(), 0u);
  EXPECT_EQ(agent.m_TVXHBA_ElementVPD_map.size(), 0u);
  EXPECT_EQ(log.level("ERROR: RM_GetVPD call failed : 9"), TVX_DBG);
  EXPECT_EQ(log.count("FC port 1000000000000001 CreateVPD failed"), 1u);
  EXPECT_EQ(agent.m_TVXHBA_FCPort_map.size(), 1u);
  EXPECT_EQ(CreateVPD(agent, PORT), 9);
}

TEST_F(Port_Vpd, SecondReadOfOnePortIsRefusedByTheMap) {
  ProviderAgent& agent = build(ALL);
  log.clear();
  EXPECT_EQ(CreateVPD(agent, PORT), RM_ERROR);
  EXPECT_EQ(log.level("Insert Failed : m_TVXHBA_VitalProductData_map"), TVX_CRIT);
}

TEST_F(Port_Vpd, InvalidNameIsRefused) {
  ProviderAgent& agent = build("");
  log.clear();
  EXPECT_EQ(CreateVPD(agent, "no name"), RM_ERROR);
  EXPECT_EQ(log.level("str2HBAName failed"), TVX_ERR);
  EXPECT_EQ(CreateVPD(agent, nullptr), RM_ERROR);
  EXPECT_EQ(log.level("Id2HBAName failed"), TVX_ERR);
}

TEST_F(Port_Vpd, ListHasNamesAndValues) {
  build(R"(, "vpd": [{"product_name": true, "value": "The product"},
      {"keyword": "SN", "value": "S200"}, {"keyword": "V6", "value": "six"}])");
  Property<Array<String>> names{{}, 0};
  Property<Array<String>> values{{}, 0};
  EXPECT_EQ(ListVPD(PORT, names.value, values.value), RM_OK);
  EXPECT_EQ(textsOf(names),
            (std::vector<std::string>{"VPD:PRODUCT_NAME", "VPD:SERIAL_NUMBER", "VPD:V6"}));
  EXPECT_EQ(textsOf(values), (std::vector<std::string>{"The product", "S200", "six"}));
  addFault(R"({"call": "LRM_GetVPD", "status": 7})");
  EXPECT_EQ(ListVPD(PORT, names.value, values.value), 7);
  EXPECT_EQ(log.count("ERROR: RM_GetVPD call failed, Returned with error code : 7"), 1u);
  EXPECT_EQ(names.value.size(), 3u);
}

TEST_F(Port_Vpd, GarbageOfTheLibraryEndsTheWalkInBounds) {
  build("");
  addFault(R"({"call": "LRM_GetVPD", "garbage": true})");
  addFault(R"({"call": "RM_GetNextVpdEntry", "unterminated_texts": true})");
  Array<String> names;
  Array<String> values;
  EXPECT_EQ(ListVPD(PORT, names, values), RM_OK);
  EXPECT_LE(names.size(), 1024u / 3);
}

TEST_F(Port_Vpd, ValueThatFillsItsBufferIsCut) {
  build(R"(, "vpd": [{"keyword": "SN", "value": "S"}])");
  addFault(R"({"call": "RM_GetNextVpdEntry", "unterminated_texts": true})");
  HBA_WWN wwpn{{0x10, 0, 0, 0, 0, 0, 0, 1}};
  std::vector<TVX_VpdEntry> entries;
  ASSERT_EQ(readVpd(wwpn, entries), RM_OK);
  ASSERT_EQ(entries.size(), 1u);
  EXPECT_EQ(std::string(entries[0].text()).size(), 255u);
}

TEST_F(Port_Vpd, NoMemory) {
  build("");
  tvxSetAllocator([](std::size_t) -> void* { return nullptr; });
  HBA_WWN wwpn{{0x10, 0, 0, 0, 0, 0, 0, 1}};
  std::vector<TVX_VpdEntry> entries;
  EXPECT_EQ(readVpd(wwpn, entries), RM_ERROR_NO_MEMORY);
  EXPECT_EQ(readVpdV2(wwpn, entries), RM_ERROR_NO_MEMORY);
}

// --- Codes -----------------------------------------------------------------------------------

TEST(Vpd_Codes, SoftwareClassifications) {
  std::string text;
  EXPECT_EQ(softwareClassificationText(2, text), 0);
  EXPECT_EQ(text, "Driver");
  EXPECT_EQ(softwareClassificationText(10, text), 0);
  EXPECT_EQ(text, "Firmware");
  EXPECT_EQ(softwareClassificationText(11, text), 0);
  EXPECT_EQ(text, "BIOD/Fcode");
  EXPECT_EQ(softwareClassificationText(32775, text), 0);
  EXPECT_EQ(text, "CIM Provider");
  EXPECT_EQ(softwareClassificationText(3, text), 32768);
  EXPECT_EQ(text, "CIM Provider");
}

TEST(Vpd_Codes, CardFunctions) {
  const std::pair<std::uint32_t, const char*> known[] = {
      {0, "Reserved"}, {16, "Infiniband"}, {64, "Ethernet"}, {80, "Fibre Channel"}, {96, "iSCSI"}};
  for (const auto& [code, expected] : known) {
    std::string text;
    EXPECT_EQ(cardFunctionText(code, text), 0);
    EXPECT_EQ(text, expected);
  }
  std::string text = "unchanged";
  EXPECT_EQ(cardFunctionText(81, text), 32768);
  EXPECT_EQ(text, "unchanged");
}

// --- Field replaceable units -----------------------------------------------------------------

class Fru : public Vpd_Test {
 protected:
  static constexpr const char* ALL =
      R"(, "fru": [{"keyword": "PA", "value": "Product"}, {"keyword": "SN", "value": "FSN"},
        {"keyword": "PN", "value": "FPN"}, {"keyword": "MN", "value": "Maker"},
        {"keyword": "DM", "value": "2419"},
        {"keyword": "UU", "hex": "00112233445566778899AABBCCDDEEFF"},
        {"keyword": "CF", "value": "50"}, {"keyword": "RI", "value": "1F"},
        {"keyword": "FN", "value": "FRU-7"}, {"keyword": "FW", "value": "fw detail"},
        {"keyword": "XX", "value": "unknown"}])";
  static constexpr const char* UUID = "00112233445566778899aabbccddeeff";
};

TEST_F(Fru, EveryKeywordGoesToItsField) {
  build(ALL);
  log.clear();
  FRU_Data fru{};
  EXPECT_EQ(TVX_Vpd::GetFRUVPD(PORT, &fru), RM_OK);
  EXPECT_STREQ(fru.productName, "Product");
  EXPECT_STREQ(fru.serialNumber, "FSN");
  EXPECT_STREQ(fru.partNumber, "FPN");
  EXPECT_STREQ(fru.manufacturer, "Maker");
  EXPECT_STREQ(fru.date, "2419");
  EXPECT_STREQ(fru.uuid, UUID);
  EXPECT_STREQ(fru.cardFunction, "50");
  EXPECT_STREQ(fru.revisionID, "1F");
  EXPECT_STREQ(fru.fruNumber, "FRU-7");
  EXPECT_STREQ(fru.firmwareDetail, "fw detail");
  EXPECT_EQ(log.count("TVX_Vpd::GetFRUVPD"), 1u);
}

TEST_F(Fru, NullArgumentsFailuresAndInvalidNames) {
  build(ALL);
  FRU_Data fru{};
  EXPECT_EQ(TVX_Vpd::GetFRUVPD(nullptr, &fru), 4);
  EXPECT_EQ(TVX_Vpd::GetFRUVPD(PORT, nullptr), 4);
  EXPECT_EQ(log.count("Invalid Parameter"), 2u);
  EXPECT_EQ(TVX_Vpd::GetFRUVPD("short", &fru), 1);
  addFault(R"({"call": "LRM_GetVPDV2", "status": 12})");
  EXPECT_EQ(TVX_Vpd::GetFRUVPD(PORT, &fru), 12);
  EXPECT_EQ(log.count("ERROR: RM_GetVPDV2 call failed : 12"), 1u);
  EXPECT_STREQ(fru.productName, "");
}

TEST_F(Fru, CardTakesTheUnitsData) {
  ProviderAgent& agent = build(ALL);
  ASSERT_EQ(agent.m_TVXHBA_Card_map.size(), 1u);
  const TVXHBA_Card& card = *agent.m_TVXHBA_Card_map[0];
  EXPECT_EQ(textOf(card.Manufacturer), "Maker");
  EXPECT_EQ(textOf(card.SerialNumber), "FSN");
  EXPECT_EQ(textOf(card.PartNumber), "FPN");
  EXPECT_EQ(textOf(card.SKU), "FRU-7");
  EXPECT_EQ(textOf(card.Tag), UUID);
  EXPECT_EQ(textOf(card.Name), "Maker Fibre Channel Adapter FSN");
  EXPECT_EQ(textOf(card.TVXSerialNumber), "SN1");
  // The map finds the card by its new key, and associations lead to it.
  EXPECT_EQ(agent.m_TVXHBA_Card_map.find(&card), 0u);
  EXPECT_TRUE(tiesKeys(agent.m_TVXHBA_CardContainsChip_map[0], &card, agent.m_TVXHBA_Chip_map[0]));
}

TEST_F(Fru, InstanceOfTheUnit) {
  ProviderAgent& agent = build(ALL);
  ASSERT_EQ(agent.m_TVXHBA_FRUVitalProductData_map.size(), 1u);
  const TVXHBA_FRUVitalProductData& fru = *agent.m_TVXHBA_FRUVitalProductData_map[0];
  EXPECT_EQ(textOf(fru.InstanceID), "FSN");
  EXPECT_EQ(textOf(fru.ElementName), "TVX HBA FRU:FSN");
  EXPECT_EQ(textOf(fru.ProductName), "Product");
  EXPECT_EQ(textOf(fru.SerialNumber), "FSN");
  EXPECT_EQ(textOf(fru.PartNumber), "FPN");
  EXPECT_EQ(textOf(fru.Manufacturer), "Maker");
  EXPECT_EQ(textOf(fru.Date), "2419");
  EXPECT_EQ(textOf(fru.UUID), UUID);
  EXPECT_EQ(textOf(fru.FRUNumber), "FRU-7");
  EXPECT_EQ(textsOf(fru.FRUFirmwareDetail), (std::vector<std::string>{"fw detail"}));
  EXPECT_EQ(numberOf(fru.CardFunction), 0x50);
  EXPECT_EQ(numberOf(fru.RevisionID), 0x1F);
  EXPECT_EQ(textsOf(fru.ASICId), (std::vector<std::string>{PORT}));
  ASSERT_EQ(agent.m_TVXHBA_FRUElementVPD_map.size(), 1u);
  EXPECT_TRUE(tiesClones(agent.m_TVXHBA_FRUElementVPD_map[0], agent.m_TVXHBA_Card_map[0], &fru));
}

TEST_F(Fru, AsicFollowsTheChipsKind) {
  ProviderAgent& sub = build(ALL, R"("sub_adapter_id": "77", )");
  EXPECT_EQ(textsOf(sub.m_TVXHBA_FRUVitalProductData_map[0]->ASICId),
            (std::vector<std::string>{"77"}));
  stopAgent();
  ProviderAgent& e200 = build(ALL, R"("device_id": "0xE200", )");
  EXPECT_EQ(textsOf(e200.m_TVXHBA_FRUVitalProductData_map[0]->ASICId),
            (std::vector<std::string>{"FSN"}));
}

TEST_F(Fru, EmptyFieldsLeaveTheCardAsItWas) {
  ProviderAgent& agent = build(R"(, "fru": [])");
  const TVXHBA_Card& card = *agent.m_TVXHBA_Card_map[0];
  EXPECT_EQ(textOf(card.Tag), "SN1");
  EXPECT_EQ(textOf(card.SerialNumber), "SN1");
  EXPECT_EQ(textOf(card.SKU), "");
  EXPECT_EQ(textOf(card.Name), "TVX1");
  EXPECT_EQ(textOf(agent.m_TVXHBA_FRUVitalProductData_map[0]->InstanceID), "SN1");
}

TEST_F(Fru, CardWithoutASerialNumberIsOnboard) {
  ProviderAgent& agent =
      build(R"(, "fru": [{"keyword": "MN", "value": "Maker"}, {"keyword": "CF", "value": "40"}])");
  EXPECT_EQ(textOf(agent.m_TVXHBA_Card_map[0]->Name), "Maker Ethernet Onboard Adapter 0");
}

TEST_F(Fru, FailedReadIsNoFailureOfTheBuild) {
  useScenario(R"({"cards": [{"serial_number": "SN1", "ports": [
      {"wwpn": "10:00:00:00:00:00:00:01"}]}],
      "faults": [{"call": "LRM_GetVPDV2", "status": 9}]})");
  ProviderAgent& agent = startAgent();
  refresh(agent);
  EXPECT_EQ(log.count("Unable to get the FRU VPD for Card : SN1 "), 1u);
  EXPECT_EQ(log.count("Unable to get the FRU VPD for Card/Port : 1000000000000001 "), 1u);
  EXPECT_EQ(agent.m_TVXHBA_FRUVitalProductData_map.size(), 0u);
  EXPECT_EQ(textOf(agent.m_TVXHBA_Card_map[0]->Tag), "SN1");
  EXPECT_EQ(agent.m_TVXHBA_FCPort_map.size(), 1u);
}

TEST_F(Fru, CardIsUpdatedOnce) {
  ProviderAgent& agent = build(ALL);
  TVXHBA_Card* card = agent.m_TVXHBA_Card_map[0];
  card->Manufacturer.set("touched");
  log.clear();
  EXPECT_EQ(TVX_Vpd::UpdateFRUToCard(agent, card, Chip_Kind::OTHER, "", PORT, 0), 0);
  EXPECT_EQ(textOf(card->Manufacturer), "touched");
  EXPECT_EQ(log.count("TVX_Vpd::UpdateFRUToCard"), 1u);
  EXPECT_EQ(log.count("TVX_Vpd::GetFRUVPD"), 0u);
}

TEST_F(Fru, DataOfAnEarlierPortStand) {
  // Without a FRU number the card's SKU stays empty, and the second port reads again.
  useScenario(R"({"cards": [{"serial_number": "SN1", "ports": [
      {"wwpn": "10:00:00:00:00:00:00:01", "fru": [{"keyword": "PA", "value": "first"}]},
      {"wwpn": "10:00:00:00:00:00:00:02", "fru": [{"keyword": "PA", "value": "second"}]}]}]})");
  ProviderAgent& agent = startAgent();
  refresh(agent);
  ASSERT_EQ(agent.m_TVXHBA_FRUVitalProductData_map.size(), 1u);
  EXPECT_EQ(textOf(agent.m_TVXHBA_FRUVitalProductData_map[0]->ProductName), "first");
  EXPECT_EQ(log.count("Insert Failed : m_TVXHBA_FRUVitalProductData_map"), 0u);
  EXPECT_EQ(agent.m_TVXHBA_FCPort_map.size(), 2u);
}

TEST_F(Fru, UuidOfAnotherCardIsNotTaken) {
  const std::string fru =
      R"("fru": [{"keyword": "UU", "hex": "00112233445566778899AABBCCDDEEFF"}])";
  useScenario(R"({"cards": [{"serial_number": "SN1", "ports": [
      {"wwpn": "10:00:00:00:00:00:00:01", )" +
              fru + R"(}]}, {"serial_number": "SN2", "ports": [
      {"wwpn": "10:00:00:00:00:00:00:02", )" +
              fru + "}]}]}");
  ProviderAgent& agent = startAgent();
  refresh(agent);
  ASSERT_EQ(agent.m_TVXHBA_Card_map.size(), 2u);
  EXPECT_EQ(textOf(agent.m_TVXHBA_Card_map[0]->Tag), UUID);
  EXPECT_EQ(textOf(agent.m_TVXHBA_Card_map[1]->Tag), "SN2");
  EXPECT_EQ(log.level("The FRU UUID of Card : SN2 is the Tag of another card"), TVX_WARN);
  EXPECT_EQ(agent.m_TVXHBA_FCPort_map.size(), 2u);
}

TEST_F(Fru, RefusedAssociationFailsTheBuild) {
  ProviderAgent& agent = build(ALL);
  TVXHBA_Card* card = agent.m_TVXHBA_Card_map[0];
  card->SKU.set("");
  agent.m_TVXHBA_FRUVitalProductData_map.clear();
  log.clear();
  EXPECT_EQ(TVX_Vpd::UpdateFRUToCard(agent, card, Chip_Kind::OTHER, "", PORT, 0), 32769);
  EXPECT_EQ(log.level("Insert Failed : TVXHBA_FRUElementVPD"), TVX_CRIT);
}

TEST_F(Fru, RefusedAssociationOfAPortIsCritical) {
  ProviderAgent& agent = build(ALL);
  agent.m_TVXHBA_Card_map[0]->SKU.set("");
  agent.m_TVXHBA_FRUVitalProductData_map.clear();
  auto& adapter = dynamic_cast<FCAdapter&>(*agent.m_pData->m_Adapters[0]);
  auto& port = dynamic_cast<FCPort&>(*adapter.getPort(0));
  Host_Build host{agent};
  Adapter_Build adapterBuild{host, adapter,
                             dynamic_cast<const FCAdapterAttributes&>(*adapter.getAttributes())};
  adapterBuild.card = agent.m_TVXHBA_Card_map[0];
  Port_Build build{adapterBuild, port,
                   dynamic_cast<const FCPortAttributes&>(*port.getAttributes())};
  EXPECT_EQ(updateCardFromFRU(build), MAP_BUILD_FAILED);
  EXPECT_EQ(log.level("Update FRU related class failed"), TVX_CRIT);
}

TEST_F(Fru, AnExceptionDuringTheUpdateOfTheSoftwareIsToldAndStopsNothing) {
  ProviderAgent& agent = build(ALL);
  Host_Build host{agent};
  tvxSetAllocator([](std::size_t) -> void* { throw std::bad_alloc(); });
  EXPECT_EQ(updateSoftwareFromFRU(host), 0);
  EXPECT_EQ(log.level("Exception occured during FRU update to cim_ "
                      "Softwareidentity/PhysicalPackage instances"),
            TVX_ERR);
}

TEST_F(Fru, SoftwareOfThePortTakesTheUnitsData) {
  ProviderAgent& agent = build(ALL);
  const std::string version = textOf(agent.m_TVXHBA_SoftwareIdentity_map[0]->VersionString);
  std::size_t updated = 0;
  for (std::size_t i = 0; i < agent.m_TVXHBA_SoftwareIdentity_map.size(); i++) {
    const TVXHBA_SoftwareIdentity& identity = *agent.m_TVXHBA_SoftwareIdentity_map[i];
    SCOPED_TRACE(textOf(identity.InstanceID));
    if (textOf(identity.PortWWN) != PORT) {
      EXPECT_EQ(textOf(identity.SerialNumber), "(null)");
      continue;
    }
    updated++;
    EXPECT_EQ(textOf(identity.Manufacturer), "Maker");
    EXPECT_EQ(textOf(identity.SerialNumber), "FSN");
    const std::string description = textOf(identity.Description);
    if (description == "Torvex FC HBA Firmware")
      EXPECT_EQ(textOf(identity.Name), "Maker Fibre Channel Adapter FSN Firmware");
    else if (description == "Torvex FC HBA Boot Code")
      EXPECT_EQ(textOf(identity.Name), "Maker Fibre Channel Adapter FSN BootCode");
    else
      EXPECT_EQ(textOf(identity.Name), textOf(identity.ElementName));
  }
  EXPECT_EQ(updated, 4u);
  EXPECT_EQ(version, "10.2.107-7");
  EXPECT_EQ(log.count("TVX_Diagnostics::UpdateFRUToFCProvider"), 1u);
  EXPECT_EQ(log.count("DeviceID 1000000000000001 "), 1u);
}

TEST_F(Fru, WithoutCardsOrSoftwareThereIsNothingToDo) {
  ProviderAgent& agent = build(ALL);
  agent.m_TVXHBA_SoftwareIdentity_map.clear();
  EXPECT_EQ(TVX_Vpd::UpdateFRUToFCProvider(agent), 0);
  EXPECT_EQ(log.count("No SoftwareIdentity instance to update the FRU Data"), 1u);
  agent.m_TVXHBA_Card_map.clear();
  EXPECT_EQ(TVX_Vpd::UpdateFRUToFCProvider(agent), 0);
  EXPECT_EQ(log.count("No FC Card exist to fetch FRU infformation"), 1u);
}

TEST_F(Fru, NoMemoryForTheSoftwaresData) {
  ProviderAgent& agent = build(ALL);
  Host_Build host{agent};
  tvxSetAllocator([](std::size_t) -> void* { return nullptr; });
  EXPECT_EQ(updateSoftwareFromFRU(host), 0);
  EXPECT_EQ(log.level("Failed to allocate the memory to hold the FRU data"), TVX_ERR);
  EXPECT_EQ(log.count("Failed to update FRU VPD data to cim_ Softwareidentity/PhysicalPackage "
                      "instances"),
            1u);
}

}  // namespace
}  // namespace cimrt::test
