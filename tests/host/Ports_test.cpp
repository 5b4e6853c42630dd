#include "cli/Ports.h"

#include <gtest/gtest.h>

namespace tvx::host {
namespace {

Value texts(std::initializer_list<const char*> list) {
  Value::List elements;
  for (const char* text : list) {
    elements.push_back(Value::string(text));
  }
  return Value::array(CMPI_string, elements);
}

Instance port(const char* serial) {
  Instance instance;
  instance.path.className = "TVXHBA_FCPort";
  instance.properties = {
      {"DeviceID", Value::string("1000000054000001")},
      {"AdapterName", Value::string("adapter-1")},
      {"Speed", Value::number(CMPI_uint64, 16000000000)},
      {"MaxSpeed", Value::number(CMPI_uint64, 32000000000)},
      {"StatusDescriptions", texts({"OK"})},
      {"OtherPortType", Value::string("N")},
      {"FCID", Value::number(CMPI_uint32, 0x10203)},
      {"FabricName", Value::string("20:00:00:00:00:00:00:01")},
      {"OperationalFirmware", Value::string("12.8")},
      {"OtherIdentifyingInfo", texts({"/dev/x", serial})},
      {"IdentifyingDescriptions", texts({"OS Device Name", "SerialNumber + Sub-AdapterID"})}};
  return instance;
}

Instance card(const char* serial, const char* model) {
  return {{"", "", "TVXHBA_Card", {}},
          {{"SerialNumber", Value::string(serial)}, {"Model", Value::string(model)}}};
}

TEST(PortsTest, APortFindsItsCardBySerialNumberAndSubAdapter) {
  const auto rows = portRows({port("SN10:1"), port("SN1"), port("SN2")},
                             {card("SN1", "Small"), card("SN10", "Large")});
  EXPECT_EQ(rows[0].model, "Large");
  EXPECT_EQ(rows[1].model, "Small");
  EXPECT_EQ(rows[2].model, "");
}

TEST(PortsTest, TheTableIsInWords) {
  EXPECT_EQ(portTable(portRows({port("SN1")}, {card("SN1", "TVX-1")})),
            "WWPN                     MODEL  SPEED      STATE  TYPE  FC ID     FABRIC              "
            "     FIRMWARE\n"
            "10:00:00:00:54:00:00:01  TVX-1  16 Gbit/s  OK     N     0x010203  "
            "20:00:00:00:00:00:00:01  12.8\n");
  EXPECT_EQ(portTable({}), "no FC ports\n");
}

TEST(PortsTest, WithoutACardTheAdaptersNameStandsForTheModel) {
  EXPECT_NE(portTable(portRows({port("SN1")}, {})).find("adapter-1"), std::string::npos);
}

TEST(PortsTest, APortWithoutAFabricShowsADash) {
  Instance lonely = port("SN1");
  lonely.properties.set("FabricName", Value::string("00:00:00:00:00:00:00:00"));
  EXPECT_NE(portTable(portRows({lonely}, {})).find("0x010203  -       12.8\n"), std::string::npos)
      << portTable(portRows({lonely}, {}));
}

TEST(PortsTest, MissingPropertiesAreUnknown) {
  const auto rows = portRows({Instance{{"", "", "TVXHBA_FCPort", {}}, {}}}, {});
  EXPECT_EQ(rows[0].state, "Unknown");
  EXPECT_EQ(rows[0].type, "Unknown");
  EXPECT_EQ(rows[0].fcId, "0x000000");
  EXPECT_EQ(speedWords(rows[0].speed), "unknown");
}

TEST(PortsTest, StatusAndTypeValuesHaveWords) {
  EXPECT_EQ(statusWords(2), "OK");
  EXPECT_EQ(statusWords(0x8015), "Link Down, Needs Reset");
  EXPECT_EQ(statusWords(99), "Unknown(99)");
  EXPECT_EQ(portTypeWords(10), "N");
  EXPECT_EQ(portTypeWords(18), "G");
  EXPECT_EQ(portTypeWords(77), "Unknown(77)");
  Instance silent = port("SN1");
  silent.properties.remove("StatusDescriptions");
  silent.properties.remove("OtherPortType");
  silent.properties.set("OperationalStatus",
                        Value::array(CMPI_uint16, {Value::number(CMPI_uint16, 10)}));
  silent.properties.set("PortType", Value::number(CMPI_uint16, 15));
  EXPECT_EQ(portRows({silent}, {})[0].state, "Stopped");
  EXPECT_EQ(portRows({silent}, {})[0].type, "F");
}

TEST(PortsTest, SpeedsAndNamesAreWrittenForPeople) {
  EXPECT_EQ(speedWords(1000000000), "1 Gbit/s");
  EXPECT_EQ(speedWords(1500000000), "1500000000 bit/s");
  EXPECT_EQ(wwnText("10000000540000ab"), "10:00:00:00:54:00:00:ab");
  EXPECT_EQ(wwnText("not a name 12345"), "not a name 12345");
  EXPECT_EQ(wwnText(""), "");
}

}  // namespace
}  // namespace tvx::host
