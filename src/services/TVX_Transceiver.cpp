#include "services/TVX_Transceiver.h"

#include <algorithm>
#include <cctype>
#include <cstring>

#include "access/TVX_MethodWrapper.h"
#include "agent/Map_Insert.h"
#include "agent/ProductSteps.h"
#include "common/CLogger.h"
#include "common/TVX_Memory.h"

namespace cimrt {

namespace {

using Transceiver = TVXHBA_Transceiver;

/// Offsets of the fields in the library's record.
enum Sff_Offset : std::size_t {
  SFF_THRESHOLDS = 296,
  SFF_IDENTITY_PRESENT = 584,
  SFF_DIAGNOSTICS_PRESENT = 585,
  SFF_THIRD_PRESENT = 586,
  SFF_IDENTIFIER = 588,
  SFF_EXT_IDENTIFIER = 589,
  SFF_CONNECTOR = 590,
  SFF_WAVELENGTH = 592,
  SFF_TEMPERATURE = 596,
  SFF_VCC = 600,
  SFF_TX_BIAS = 604,
  SFF_TX_POWER = 608,
  SFF_RX_POWER = 612,
  SFF_OUI = 616,
  SFF_VENDOR = 620,
  SFF_PART_NUMBER = 638,
  SFF_REVISION = 656,
  SFF_SERIAL_NUMBER = 662,
  SFF_DATE_CODE = 680,
};

constexpr std::size_t DATE_CODE_LENGTH = 6;

/// The record as it came, read by offset.
class Sff_Record {
 public:
  explicit Sff_Record(const std::uint8_t* bytes) : m_Bytes(bytes) {}

  template <class T>
  T number(std::size_t offset) const {
    T value;
    std::memcpy(&value, m_Bytes + offset, sizeof value);
    return value;
  }
  std::uint8_t byte(std::size_t offset) const { return m_Bytes[offset]; }
  bool flag(std::size_t offset) const { return m_Bytes[offset] != 0; }
  /// The text from `offset`, which ends with a NUL or where the next field begins.
  std::string text(std::size_t offset, std::size_t next) const {
    const char* start = reinterpret_cast<const char*>(m_Bytes + offset);
    return std::string(start, strnlen(start, next - offset));
  }
  std::string trimmed(std::size_t offset, std::size_t next) const {
    std::string cut = text(offset, next);
    cut.erase(cut.find_last_not_of(' ') + 1);
    return cut;
  }

 private:
  const std::uint8_t* m_Bytes;
};

// --- Thresholds ------------------------------------------------------------------------------

float temperature(std::uint16_t word) {
  return static_cast<float>(word) / 256.0F;
}

float voltage(std::uint16_t word) {
  return static_cast<float>(word) * 100.0F / 1000000.0F;
}

float current(std::uint16_t word) {
  const auto value = static_cast<float>(word);
  return (value + value) / 1000.0F;
}

float power(std::uint16_t word) {
  return static_cast<float>(word) * 0.1F / 1000.0F;
}

struct Threshold_Row {
  Property<float> Transceiver::*property;
  float (*scale)(std::uint16_t word);
};

// In the order of the words.
constexpr Threshold_Row THRESHOLDS[] = {
    {&Transceiver::TemperatureHighAlarm, temperature},
    {&Transceiver::TemperatureLowAlarm, lowTemperature},
    {&Transceiver::TemperatureHighWarning, temperature},
    {&Transceiver::TemperatureLowWarning, lowTemperature},
    {&Transceiver::VoltageHighAlarm, voltage},
    {&Transceiver::VoltageLowAlarm, voltage},
    {&Transceiver::VoltageHighWarning, voltage},
    {&Transceiver::VoltageLowWarning, voltage},
    {&Transceiver::CurrentHighAlarm, current},
    {&Transceiver::CurrentLowAlarm, current},
    {&Transceiver::CurrentHighWarning, current},
    {&Transceiver::CurrentLowWarning, current},
    {&Transceiver::TxPowerHighAlarm, power},
    {&Transceiver::TxPowerLowAlarm, power},
    {&Transceiver::TxPowerHighWarning, power},
    {&Transceiver::TxPowerLowWarning, power},
    {&Transceiver::RxPowerHighAlarm, power},
    {&Transceiver::RxPowerLowAlarm, power},
    {&Transceiver::RxPowerHighWarning, power},
    {&Transceiver::RxPowerLowWarning, power},
};

void setThresholds(Transceiver& made, const Sff_Record& record) {
  std::size_t offset = SFF_THRESHOLDS;
  for (const Threshold_Row& row : THRESHOLDS) {
    (made.*row.property).set(row.scale(record.number<std::uint16_t>(offset)));
    offset += sizeof(std::uint16_t);
  }
}

// --- Readings --------------------------------------------------------------------------------

struct Reading_Row {
  Property<float> Transceiver::*property;
  std::size_t offset;
  const char* label;
  const char* unit;
};

constexpr Reading_Row READINGS[] = {
    {&Transceiver::Temperature, SFF_TEMPERATURE, "Temperature: ", "C"},
    {&Transceiver::Vcc, SFF_VCC, "Vcc:  ", "V"},
    {&Transceiver::TxBiasCurrent, SFF_TX_BIAS, "TxBiasCurrent: ", "mA"},
    {&Transceiver::TxPower, SFF_TX_POWER, "TxPower: ", "mW"},
    {&Transceiver::RxPower, SFF_RX_POWER, "RxPower: ", "mW"},
};

void setReadings(Transceiver& made, const Sff_Record& record) {
  for (const Reading_Row& row : READINGS) {
    const auto value = record.number<float>(row.offset);
    (made.*row.property).set(value);
    TVX_LOG(TVX_DBG, "%s%-6.2f %s", row.label, static_cast<double>(value), row.unit);
  }
  made.TemperatureUnit.set("Celsius");
}

// --- Identity --------------------------------------------------------------------------------

void setKind(Transceiver& made, const Sff_Record& record) {
  made.Identifier.set(record.byte(SFF_IDENTIFIER));
  TVX_LOG(TVX_DBG, "Identifier: %xh", made.Identifier.value);
  made.ExtIdentifier.set(record.byte(SFF_EXT_IDENTIFIER));
  TVX_LOG(TVX_DBG, "ExtIdentifier: %xh", made.ExtIdentifier.value);
  made.Connector.set(record.byte(SFF_CONNECTOR));
  TVX_LOG(TVX_DBG, "Connector: %xh", made.Connector.value);
  made.WaveLength.set(record.number<std::uint16_t>(SFF_WAVELENGTH));
  TVX_LOG(TVX_DBG, "Wavelength: %d nm", made.WaveLength.value);
}

void setTag(Transceiver& made, const char* deviceID) {
  const std::string tag = formatText("%s:%s", deviceID, made.SerialNumber.value.c_str());
  made.Tag.set(tag.c_str());
  made.Name.set(tag.c_str());
  made.ElementName.set(tag.c_str());
  made.InstanceID.set(tag.c_str());
}

void setVendor(Transceiver& made, const Sff_Record& record) {
  made.Manufacturer.set(record.trimmed(SFF_VENDOR, SFF_PART_NUMBER).c_str());
  TVX_LOG(TVX_DBG, "VendorName: %s", made.Manufacturer.value.c_str());
  made.OUI.set(formatText("%02X-%02X-%02x", record.byte(SFF_OUI), record.byte(SFF_OUI + 1),
                          record.byte(SFF_OUI + 2))
                   .c_str());
  TVX_LOG(TVX_DBG, "VendorOUI: %s", made.OUI.value.c_str());
  made.PartNumber.set(record.text(SFF_PART_NUMBER, SFF_REVISION).c_str());
  TVX_LOG(TVX_DBG, "VendorPN: %s", made.PartNumber.value.c_str());
  made.Version.set(record.trimmed(SFF_REVISION, SFF_SERIAL_NUMBER).c_str());
  TVX_LOG(TVX_DBG, "VendorRev: %s", made.Version.value.c_str());
  made.SerialNumber.set(record.trimmed(SFF_SERIAL_NUMBER, SFF_DATE_CODE).c_str());
  TVX_LOG(TVX_DBG, "VendorSN: %s#", made.SerialNumber.value.c_str());
}

void setDate(Transceiver& made, const Sff_Record& record) {
  const std::string code = record.text(SFF_DATE_CODE, SFF_DATE_CODE + DATE_CODE_LENGTH);
  TVX_LOG(TVX_DBG, "DateCode: %s", code.c_str());
  const std::string text = manufactureDateText(code);
  TVX_LOG(TVX_DBG, "ManufactureDate: %s", text.c_str());
  Datetime date;
  if (date.set(text.c_str())) made.ManufactureDate.set(date);
}

void setConstants(Transceiver& made) {
  made.CreationClassName.set("TVXHBA_Transceiver");
  made.Description.set("Torvex PhysicalComponent Data");
  made.RemovalConditions.set(2);
  made.OperationalStatus.set({0});
  made.StatusDescriptions.set({"unknown"});
}

void setStatus(Transceiver& made, const Sff_Record& record) {
  const bool complete = record.flag(SFF_IDENTITY_PRESENT) && record.flag(SFF_DIAGNOSTICS_PRESENT) &&
                        record.flag(SFF_THIRD_PRESENT);
  made.SFPStatus.set(complete ? 0 : 1);
}

Ref<Transceiver> describe(const char* deviceID, const Sff_Record& record) {
  auto made = makeInstance<Transceiver>();
  TVX_LOG(TVX_DBG, "PhysicalComponentInstance for : %s", deviceID);
  setConstants(*made);
  setVendor(*made, record);
  setDate(*made, record);
  setTag(*made, deviceID);
  setStatus(*made, record);
  if (record.flag(SFF_IDENTITY_PRESENT)) setKind(*made, record);
  if (record.flag(SFF_DIAGNOSTICS_PRESENT)) {
    setReadings(*made, record);
    setThresholds(*made, record);
  }
  return made;
}

/// The record, or null with the failure logged.
TVX_Block readSff(const HBA_WWN& wwpn) {
  TVX_Block block = tvxAllocate(RM_SFF_DATA_SIZE);
  if (!block) {
    TVX_LOG(TVX_ERR, "ERROR: tvxcimGetDigitalDiagnosticsData: Error - Unable to allocate buffer.");
    return block;
  }
  std::uint32_t size = RM_SFF_DATA_SIZE;
  if (LRM_GetSffData(wwpn, block.get(), &size) != RM_OK) {
    TVX_LOG(TVX_DBG, "Unable to obtain transceiver data for this host bus adapter.");
    return nullptr;
  }
  TVX_LOG(TVX_DBG, "RM_GetSffData succesful");
  return block;
}

}  // namespace

float lowTemperature(std::uint16_t word) {
  if ((word & 0x8000U) == 0) return temperature(word);
  const int whole = ((word ^ 32767) + 1) / 2560;  // in whole numbers, as the module's word is read
  return -static_cast<float>(whole);
}

std::string manufactureDateText(const std::string& dateCode) {
  const auto isDigit = [](char c) { return std::isdigit(static_cast<unsigned char>(c)) != 0; };
  if (dateCode.size() != DATE_CODE_LENGTH ||
      !std::all_of(dateCode.begin(), dateCode.end(), isDigit))
    return {};
  const int year = std::stoi(dateCode.substr(0, 2));
  const int month = std::stoi(dateCode.substr(2, 2));
  const int day = std::stoi(dateCode.substr(4, 2));
  return formatText("%04d%02d%02d000000.000000+000", year + (year > 69 ? 1900 : 2000), month, day);
}

TVXHBA_Transceiver* CreateTransceiver(ProviderAgent& agent, const char* deviceID) {
  HBA_WWN wwpn{};
  if (TVX_MethodWrapper::deviceIdToWWN(&wwpn, deviceID) != RM_OK) return nullptr;
  const TVX_Block block = readSff(wwpn);
  if (!block) return nullptr;
  Ref<Transceiver> made = describe(deviceID, Sff_Record(block.get()));
  TVX_LOG(TVX_DBG, "Success...");
  return insertInto(agent.m_TVXHBA_Transceiver_map, std::move(made),
                    "Insert Failed : m_CIM_PhysicalComponent_map");
}

std::int32_t buildTransceiver(Port_Build& build) {
  ProviderAgent& agent = build.adapter.host.agent;
  const TVXHBA_Transceiver* transceiver = CreateTransceiver(agent, build.port.m_Name.c_str());
  if (!transceiver) {
    TVX_LOG(TVX_DBG, "Failed Creating TVXHBA_Transceiver");
    return 0;
  }
  if (!build.controller) return 0;
  return associate(agent.m_TVXHBA_TransceiverComponent_map, build.controller, transceiver,
                   "Insert Failed : m_Component_map")
             ? 0
             : MAP_BUILD_FAILED;
}

}  // namespace cimrt
