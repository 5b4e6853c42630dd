// Vital product data, transceiver and flash contents of a port.
#include "state/Scenario_Parts.h"

namespace tvx::sim {
namespace {

std::vector<Vpd_Entry> read_entries(const Json_Reader& reader, const std::string& key,
                                    std::vector<Vpd_Entry> made) {
  if (!reader.has(key)) return made;
  std::vector<Vpd_Entry> entries;
  for (const Json_Reader& item : reader.objects(key)) {
    Vpd_Entry entry;
    entry.keyword = item.text("keyword", {});
    if (item.flag("product_name", false)) entry.keyword = "\x82\x82";
    if (entry.keyword.size() != 2) item.fail("keyword", "must be two characters");
    entry.value = item.text("value", {});
    if (item.has("hex")) {
      const Bytes bytes = item.bytes("hex");
      entry.value.assign(bytes.begin(), bytes.end());
    }
    if (entry.value.size() > 255) item.fail("value", "must be at most 255 bytes");
    item.finish();
    entries.push_back(std::move(entry));
  }
  return entries;
}

std::vector<Vpd_Entry> made_vpd(const Card& card) {
  return {{"\x82\x82", card.model_description},
          {"PN", card.model},
          {"SN", card.serial_number},
          {"MN", "1E77"},
          {"EC", "A-5500"},
          {"V0", "PCI Express"},
          {"V1", card.model_description},
          {"V2", card.model},
          {"V4", "1"},
          {"VB", "5.30"},
          {"YA", "Torvex"}};
}

std::vector<Vpd_Entry> made_fru(const Card& card, std::size_t index) {
  std::string uuid = "TORVEX-CARD-0000";
  uuid[15] = static_cast<char>('0' + index % 10);
  return {{"PA", card.model_description},
          {"SN", card.serial_number},
          {"PN", card.model},
          {"MN", card.manufacturer},
          {"DM", "2419"},
          {"UU", uuid},
          {"CF", "50"},
          {"RI", "0B"},
          {"FN", "00AE912"},
          {"FW", card.firmware_version}};
}

std::array<std::uint16_t, 20> made_thresholds() {
  // Alarm and warning limits in the units of the transceiver: 1/256 C, 100 uV, 2 uA, 0.1 uW.
  return {0x4B00, 0xFB00, 0x4600, 0x0000, 0x8CA0, 0x7530, 0x88B8, 0x7918, 0x1770, 0x03E8,
          0x1388, 0x07D0, 0x1B58, 0x0320, 0x1388, 0x04E2, 0x1F40, 0x00C8, 0x1770, 0x0190};
}

void read_flags(const Json_Reader& reader, Transceiver& transceiver) {
  transceiver.flags = {reader.flag("identity", true), reader.flag("diagnostics", true),
                       reader.flag("status", true)};
}

void read_readings(const Json_Reader& reader, Transceiver& transceiver) {
  const auto real = [&reader](const char* key, float fallback) {
    return static_cast<float>(reader.real(key, static_cast<double>(fallback)));
  };
  transceiver.temperature = real("temperature", transceiver.temperature);
  transceiver.vcc = real("vcc", transceiver.vcc);
  transceiver.tx_bias = real("tx_bias", transceiver.tx_bias);
  transceiver.tx_power = real("tx_power", transceiver.tx_power);
  transceiver.rx_power = real("rx_power", transceiver.rx_power);
}

void read_thresholds(const Json_Reader& reader, Transceiver& transceiver) {
  transceiver.thresholds = made_thresholds();
  const nlohmann::json& given = reader.raw("thresholds");
  if (given.is_null()) return;
  if (!given.is_array() || given.size() != transceiver.thresholds.size()) {
    reader.fail("thresholds", "must be an array of 20 numbers");
  }
  for (std::size_t i = 0; i < given.size(); ++i) {
    const auto number = json_unsigned(given[i]);
    if (!number || *number > UINT16_MAX) reader.fail("thresholds", "must hold 16-bit numbers");
    transceiver.thresholds[i] = static_cast<std::uint16_t>(*number);
  }
}

void read_transceiver(const Json_Reader& port_reader, Port& port) {
  Transceiver& transceiver = port.transceiver;
  static const nlohmann::json nothing = nlohmann::json::object();
  const Json_Reader reader =
      port_reader.object("transceiver").value_or(Json_Reader(nothing, "/transceiver"));
  transceiver.present = reader.flag("present", true);
  read_flags(reader, transceiver);
  transceiver.identifier = reader.number<std::uint8_t>("identifier", 3);
  transceiver.ext_identifier = reader.number<std::uint8_t>("ext_identifier", 4);
  transceiver.connector = reader.number<std::uint8_t>("connector", 7);
  transceiver.wavelength = reader.number<std::uint16_t>("wavelength", 850);
  read_readings(reader, transceiver);
  if (reader.has("oui")) transceiver.oui = reader.bytes("oui");
  transceiver.oui.resize(3);
  transceiver.vendor = reader.text("vendor", "LUMENTRA");
  transceiver.part_number = reader.text("part_number", "LTF8502-BC");
  transceiver.revision = reader.text("revision", "A1");
  transceiver.serial_number =
      reader.text("serial_number", "LU" + std::to_string(194000 + port.card * 10 + port.number));
  transceiver.date_code = reader.text("date_code", "240512");
  read_thresholds(reader, transceiver);
  reader.finish();
}

std::vector<Flash_Entry> made_flash(const Card& card) {
  return {{0x00020000,
           0x00040000,
           {0x02F1A4C0, 0x00001234},
           "Initial Load",
           "LOAD",
           card.firmware_version,
           true},
          {0x00060000,
           0x00080000,
           {0x07C3B5D1, 0x00002345},
           "Port Firmware",
           "FCFW",
           card.firmware_version,
           true},
          {0x000E0000,
           0x00030000,
           {0x03B1C6E2, 0x00003456},
           "Boot Code",
           "BOOT",
           card.option_rom_version,
           false}};
}

void read_flash(const Json_Reader& reader, const Card& card, Port& port) {
  port.flash = made_flash(card);
  if (!reader.has("flash")) return;
  port.flash.clear();
  for (const Json_Reader& item : reader.objects("flash")) {
    Flash_Entry entry;
    entry.start = item.number<std::uint32_t>("start", 0);
    entry.length = item.number<std::uint32_t>("length", 0);
    entry.program_id = {item.number<std::uint32_t>("id", 0), item.number<std::uint32_t>("id2", 0)};
    entry.description = item.text("description", {});
    entry.type = item.text("type", {});
    entry.version = item.text("version", {});
    entry.wakeup = item.flag("wakeup", false);
    const auto count = item.number<std::uint8_t>("count", 1);
    item.finish();
    port.flash.insert(port.flash.end(), count, entry);
  }
}

const std::map<std::string, std::uint32_t> pci_families = {
    {"none", 0}, {"tamirol", 1}, {"kora", 2}, {"vestra", 3}, {"ondrel", 4}, {"brisca", 5}};

void read_pci(const Json_Reader& port_reader, Pci_Function& pci) {
  const std::optional<Json_Reader> reader = port_reader.object("pci");
  if (!reader) return;
  pci.family = reader->choice("family", pci.family, pci_families);
  pci.vendor_id = reader->number<std::uint16_t>("vendor_id", pci.vendor_id);
  pci.device_id = reader->number<std::uint16_t>("device_id", pci.device_id);
  pci.subsystem_id = reader->number<std::uint16_t>("subsystem_id", pci.subsystem_id);
  pci.revision = reader->number<std::uint8_t>("revision", pci.revision);
  pci.interrupt_line = reader->number<std::uint8_t>("interrupt_line", pci.interrupt_line);
  const nlohmann::json& words = reader->raw("words");
  if (!words.is_null() && !words.is_array()) reader->fail("words", "must be an array of numbers");
  for (const nlohmann::json& word : words) {
    const auto number = json_unsigned(word);
    if (!number || *number > UINT32_MAX) reader->fail("words", "must hold 32-bit numbers");
    pci.words.push_back(static_cast<std::uint32_t>(*number));
  }
  reader->finish();
}

}  // namespace

void read_product(const Json_Reader& reader, const Card& card, Port& port) {
  port.vpd = read_entries(reader, "vpd", made_vpd(card));
  port.fru = read_entries(reader, "fru", made_fru(card, port.card));
  read_transceiver(reader, port);
  read_flash(reader, card, port);
  read_pci(reader, port.pci);
}

}  // namespace tvx::sim
