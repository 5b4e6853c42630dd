// The transceiver of a port.
#include "../agent/Agent_Fixture.h"
#include "../agent/Instance_Checks.h"
#include "common/TVX_Memory.h"
#include "services/TVX_Transceiver.h"

namespace cimrt::test {
namespace {

constexpr const char* PORT = "1000000000000001";

class Transceivers : public Agent_Test {
 protected:
  ProviderAgent& build(const std::string& transceiver) {
    return builtAgent(
        R"({"cards": [{"ports": [{"wwpn": "10:00:00:00:00:00:00:01", "transceiver": )" +
        transceiver + "}]}]}");
  }

  static constexpr const char* ALL =
      R"({"identifier": 3, "ext_identifier": 4, "connector": 7, "wavelength": 850,
          "temperature": 36.25, "vcc": 3.5, "tx_bias": 6.75, "tx_power": 0.5, "rx_power": 0.25,
          "oui": "0A0BCD", "vendor": "LUMENTRA", "part_number": "LTF8502-BC", "revision": "A1",
          "serial_number": "LU1", "date_code": "690115",
          "thresholds": [19200, 51200, 17920, 512, 36000, 30000, 35000, 31000, 6000, 1000,
                         5000, 2000, 7000, 800, 5000, 1250, 8000, 200, 6000, 400]})";
};

TEST_F(Transceivers, Identity) {
  ProviderAgent& agent = build(ALL);
  ASSERT_EQ(agent.m_TVXHBA_Transceiver_map.size(), 1u);
  const TVXHBA_Transceiver& made = *agent.m_TVXHBA_Transceiver_map[0];
  EXPECT_TRUE(made.__name_space == "root/torvex");
  EXPECT_EQ(textOf(made.CreationClassName), "TVXHBA_Transceiver");
  EXPECT_EQ(textOf(made.Description), "Torvex PhysicalComponent Data");
  EXPECT_EQ(numberOf(made.RemovalConditions), 2);
  EXPECT_EQ(numbersOf(made.OperationalStatus), (std::vector<std::uint16_t>{0}));
  EXPECT_EQ(textsOf(made.StatusDescriptions), (std::vector<std::string>{"unknown"}));
  for (const auto* text : {&made.Tag, &made.Name, &made.ElementName, &made.InstanceID})
    EXPECT_EQ(textOf(*text), "1000000000000001:LU1");
  EXPECT_EQ(textOf(made.Manufacturer), "LUMENTRA");
  EXPECT_EQ(textOf(made.OUI), "0A-0B-cd");
  EXPECT_EQ(textOf(made.PartNumber).substr(0, 10), "LTF8502-BC");
  EXPECT_EQ(textOf(made.Version), "A1");
  EXPECT_EQ(textOf(made.SerialNumber), "LU1");
  EXPECT_EQ(numberOf(made.Identifier), 3);
  EXPECT_EQ(numberOf(made.ExtIdentifier), 4);
  EXPECT_EQ(numberOf(made.Connector), 7);
  EXPECT_EQ(numberOf(made.WaveLength), 850);
  EXPECT_EQ(numberOf(made.SFPStatus), 0);
  char date[Datetime::ASCII_SIZE];
  made.ManufactureDate.value.ascii(date, false);
  EXPECT_STREQ(date, "20690115000000.000000+000");
}

TEST_F(Transceivers, PartNumberKeepsItsBlanks) {
  ProviderAgent& agent = build(ALL);
  EXPECT_EQ(textOf(agent.m_TVXHBA_Transceiver_map[0]->PartNumber), "LTF8502-BC      ");
}

TEST_F(Transceivers, ReadingsAndThresholds) {
  ProviderAgent& agent = build(ALL);
  const TVXHBA_Transceiver& made = *agent.m_TVXHBA_Transceiver_map[0];
  EXPECT_FLOAT_EQ(made.Temperature.value, 36.25F);
  EXPECT_EQ(textOf(made.TemperatureUnit), "Celsius");
  EXPECT_FLOAT_EQ(made.Vcc.value, 3.5F);
  EXPECT_FLOAT_EQ(made.TxBiasCurrent.value, 6.75F);
  EXPECT_FLOAT_EQ(made.TxPower.value, 0.5F);
  EXPECT_FLOAT_EQ(made.RxPower.value, 0.25F);
  EXPECT_FLOAT_EQ(made.TemperatureHighAlarm.value, 75.0F);
  EXPECT_FLOAT_EQ(made.TemperatureLowAlarm.value, -18.0F);  // (0xC800 ^ 0x7FFF) + 1 = 47104
  EXPECT_FLOAT_EQ(made.TemperatureHighWarning.value, 70.0F);
  EXPECT_FLOAT_EQ(made.TemperatureLowWarning.value, 2.0F);
  EXPECT_FLOAT_EQ(made.VoltageHighAlarm.value, 3.6F);
  EXPECT_FLOAT_EQ(made.VoltageLowAlarm.value, 3.0F);
  EXPECT_FLOAT_EQ(made.VoltageHighWarning.value, 3.5F);
  EXPECT_FLOAT_EQ(made.VoltageLowWarning.value, 3.1F);
  EXPECT_FLOAT_EQ(made.CurrentHighAlarm.value, 12.0F);
  EXPECT_FLOAT_EQ(made.CurrentLowAlarm.value, 2.0F);
  EXPECT_FLOAT_EQ(made.CurrentHighWarning.value, 10.0F);
  EXPECT_FLOAT_EQ(made.CurrentLowWarning.value, 4.0F);
  EXPECT_FLOAT_EQ(made.TxPowerHighAlarm.value, 0.7F);
  EXPECT_FLOAT_EQ(made.TxPowerLowAlarm.value, 0.08F);
  EXPECT_FLOAT_EQ(made.TxPowerHighWarning.value, 0.5F);
  EXPECT_FLOAT_EQ(made.TxPowerLowWarning.value, 0.125F);
  EXPECT_FLOAT_EQ(made.RxPowerHighAlarm.value, 0.8F);
  EXPECT_FLOAT_EQ(made.RxPowerLowAlarm.value, 0.02F);
  EXPECT_FLOAT_EQ(made.RxPowerHighWarning.value, 0.6F);
  EXPECT_FLOAT_EQ(made.RxPowerLowWarning.value, 0.04F);
}

TEST_F(Transceivers, EveryFieldIsLogged) {
  build(ALL);
  const std::vector<std::string> texts = {
      "RM_GetSffData succesful",
      "PhysicalComponentInstance for : 1000000000000001",
      "VendorName: LUMENTRA",
      "VendorOUI: 0A-0B-cd",
      "VendorPN: LTF8502-BC      ",
      "VendorRev: A1",
      "VendorSN: LU1#",
      "DateCode: 690115",
      "ManufactureDate: 20690115000000.000000+000",
      "Identifier: 3h",
      "ExtIdentifier: 4h",
      "Connector: 7h",
      "Wavelength: 850 nm",
      "Temperature: 36.25  C",
      "Vcc:  3.50   V",
      "TxBiasCurrent: 6.75   mA",
      "TxPower: 0.50   mW",
      "RxPower: 0.25   mW",
      "Success...",
  };
  // The programs in the flash, which are read next, end with the same text.
  std::vector<std::string> wanted = texts;
  wanted.push_back("Success...");
  EXPECT_EQ(log.only(texts), wanted);
}

TEST_F(Transceivers, TiesTheController) {
  ProviderAgent& agent = build(ALL);
  ASSERT_EQ(agent.m_TVXHBA_TransceiverComponent_map.size(), 1u);
  EXPECT_TRUE(tiesClones(agent.m_TVXHBA_TransceiverComponent_map[0],
                         agent.m_TVXHBA_PortController_map[0], agent.m_TVXHBA_Transceiver_map[0]));
}

TEST_F(Transceivers, WithoutIdentityItsFieldsStayNull) {
  ProviderAgent& agent = build(R"({"identity": false})");
  const TVXHBA_Transceiver& made = *agent.m_TVXHBA_Transceiver_map[0];
  EXPECT_EQ(numberOf(made.Identifier), -1);
  EXPECT_EQ(numberOf(made.ExtIdentifier), -1);
  EXPECT_EQ(numberOf(made.Connector), -1);
  EXPECT_EQ(numberOf(made.WaveLength), -1);
  EXPECT_FALSE(made.Temperature.is_null());
  EXPECT_EQ(numberOf(made.SFPStatus), 1);
  EXPECT_EQ(textOf(made.Manufacturer), "LUMENTRA");
}

TEST_F(Transceivers, WithoutDiagnosticsReadingsAndThresholdsStayNull) {
  ProviderAgent& agent = build(R"({"diagnostics": false})");
  const TVXHBA_Transceiver& made = *agent.m_TVXHBA_Transceiver_map[0];
  for (const auto* value :
       {&made.Temperature, &made.Vcc, &made.TxBiasCurrent, &made.TxPower, &made.RxPower,
        &made.TemperatureHighAlarm, &made.VoltageLowAlarm, &made.CurrentHighWarning,
        &made.TxPowerLowWarning, &made.RxPowerLowWarning})
    EXPECT_TRUE(value->is_null());
  EXPECT_EQ(textOf(made.TemperatureUnit), "(null)");
  EXPECT_EQ(numberOf(made.Identifier), 3);
  EXPECT_EQ(numberOf(made.SFPStatus), 1);
}

TEST_F(Transceivers, ThirdFlagDecidesTheStatusAlone) {
  ProviderAgent& agent = build(R"({"status": false})");
  const TVXHBA_Transceiver& made = *agent.m_TVXHBA_Transceiver_map[0];
  EXPECT_EQ(numberOf(made.SFPStatus), 1);
  EXPECT_EQ(numberOf(made.Identifier), 3);
  EXPECT_FALSE(made.Temperature.is_null());
}

TEST_F(Transceivers, PortWithoutOneIsBuiltAllTheSame) {
  ProviderAgent& agent = build(R"({"present": false})");
  EXPECT_EQ(agent.m_TVXHBA_Transceiver_map.size(), 0u);
  EXPECT_EQ(log.count("Unable to obtain transceiver data for this host bus adapter."), 1u);
  EXPECT_EQ(log.level("Failed Creating TVXHBA_Transceiver"), TVX_DBG);
  EXPECT_EQ(agent.m_TVXHBA_ControlledBy_map.size(), 1u);
}

TEST_F(Transceivers, SecondOneOfThePortIsRefused) {
  ProviderAgent& agent = build(ALL);
  EXPECT_EQ(CreateTransceiver(agent, PORT), nullptr);
  EXPECT_EQ(log.level("Insert Failed : m_CIM_PhysicalComponent_map"), TVX_CRIT);
}

TEST_F(Transceivers, InvalidNameAndNoMemory) {
  ProviderAgent& agent = build(ALL);
  EXPECT_EQ(CreateTransceiver(agent, "no"), nullptr);
  tvxSetAllocator([](std::size_t) -> void* { return nullptr; });
  EXPECT_EQ(CreateTransceiver(agent, PORT), nullptr);
  EXPECT_EQ(log.count("ERROR: tvxcimGetDigitalDiagnosticsData: Error - Unable to allocate buffer."),
            1u);
}

TEST_F(Transceivers, TextsWithoutAnEndStayInTheirFields) {
  useScenario(R"({"cards": [{"ports": [{"wwpn": "10:00:00:00:00:00:00:01"}]}],
      "faults": [{"call": "LRM_GetSffData", "unterminated_texts": true}]})");
  ProviderAgent& agent = startAgent();
  refresh(agent);
  ASSERT_EQ(agent.m_TVXHBA_Transceiver_map.size(), 1u);
  const TVXHBA_Transceiver& made = *agent.m_TVXHBA_Transceiver_map[0];
  EXPECT_EQ(made.Manufacturer.value.size(), 18u);
  EXPECT_EQ(made.PartNumber.value.size(), 18u);
  EXPECT_EQ(made.Version.value.size(), 6u);
  EXPECT_EQ(made.SerialNumber.value.size(), 18u);
}

TEST(Transceiver_Dates, CenturyAndMalformedCodes) {
  EXPECT_EQ(manufactureDateText("690115"), "20690115000000.000000+000");
  EXPECT_EQ(manufactureDateText("700115"), "19700115000000.000000+000");
  EXPECT_EQ(manufactureDateText("991231"), "19991231000000.000000+000");
  EXPECT_EQ(manufactureDateText("000229"), "20000229000000.000000+000");
  EXPECT_EQ(manufactureDateText("24051"), "");
  EXPECT_EQ(manufactureDateText("24051x"), "");
  EXPECT_EQ(manufactureDateText("      "), "");
}

TEST(Transceiver_Thresholds, LowTemperaturesHaveARuleOfTheirOwn) {
  EXPECT_FLOAT_EQ(lowTemperature(0x0500), 5.0F);
  EXPECT_FLOAT_EQ(lowTemperature(0x7FFF), 32767.0F / 256.0F);
  // 0x8000 ^ 0x7FFF = 0xFFFF, plus 1 is 65536; by 2560 without a rest 25.
  EXPECT_FLOAT_EQ(lowTemperature(0x8000), -25.0F);
  // 0xFB00 ^ 0x7FFF = 0x84FF, plus 1 is 34048; by 2560 is 13.3, cut.
  EXPECT_FLOAT_EQ(lowTemperature(0xFB00), -13.0F);
  EXPECT_FLOAT_EQ(lowTemperature(0xFFFF), -12.0F);
}

}  // namespace
}  // namespace cimrt::test
