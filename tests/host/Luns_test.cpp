#include "cli/Luns.h"

#include <gtest/gtest.h>

namespace tvx::host {
namespace {

constexpr const char* PORT = "10000254560C3001";
constexpr const char* TARGET = "500C0FF12A001001";

Instance endpoint(const std::string& lun, const char* description = nullptr,
                  const char* model = "ARRAY 7200      ") {
  Instance instance;
  instance.path.className = "TVXHBA_SCSIProtocolEndpoint";
  const std::string words = description != nullptr
                                ? description
                                : "ACMESTOR ARRAY 7200       Revision 0410 Serial Number SN1";
  instance.properties = {
      {"Name", Value::string(std::string(PORT) + ":" + TARGET + ":" + lun)},
      {"ElementName", Value::string(model)},
      {"Description", Value::string(words)},
      {"FCID", Value::number(CMPI_uint64, 0x10203)},
      {"OtherIdentifyingInfo", Value::array(CMPI_string, {Value::string("/dev/sda")})}};
  return instance;
}

Instance device(const std::string& identifier, const std::string& lun, unsigned type) {
  Instance instance;
  instance.path.className = "TVXHBA_StorageVolume";
  instance.properties = {
      {"DeviceID", Value::string(std::string(PORT) + "_" + TARGET + "_" + identifier + "_" + lun)},
      {"DeviceType", Value::number(CMPI_uint16, type)},
      {"Capacity", Value::number(CMPI_uint64, 1ULL << 30)}};
  return instance;
}

const std::string LUN5 = "0005000000000000";
const std::string LUN6 = "0006000000000000";

TEST(LunsTest, AnEndpointFindsItsDevice) {
  const auto rows =
      lunRows({endpoint(LUN5), endpoint(LUN6)}, {device("", LUN6, 1), device("AB_CD", LUN5, 0)});
  ASSERT_EQ(rows.size(), 2U);
  EXPECT_EQ(rows[0].lun, "5");
  EXPECT_EQ(rows[0].type, "disk");
  EXPECT_EQ(rows[0].capacity, 1ULL << 30);
  EXPECT_EQ(rows[0].className, "TVXHBA_StorageVolume");
  EXPECT_EQ(rows[1].type, "tape");
}

TEST(LunsTest, TheDescriptionIsTakenApart) {
  const LunRow row = lunRows({endpoint(LUN5)}, {}).at(0);
  EXPECT_EQ(row.port, "10:00:02:54:56:0C:30:01");
  EXPECT_EQ(row.target, "50:0C:0F:F1:2A:00:10:01");
  EXPECT_EQ(row.targetId, "0x010203");
  EXPECT_EQ(row.vendor, "ACMESTOR");
  EXPECT_EQ(row.model, "ARRAY 7200");
  EXPECT_EQ(row.revision, "0410");
  EXPECT_EQ(row.serial, "SN1");
  EXPECT_EQ(row.osDevice, "/dev/sda");
  EXPECT_TRUE(row.answers);
  EXPECT_EQ(row.type, "");
  EXPECT_FALSE(row.capacity.has_value());
}

TEST(LunsTest, AUnitThatAnsweredNothingIsMarked) {
  const LunRow row =
      lunRows({endpoint(LUN5, "Unknown Unknown Revision Unkn Serial Number Unknown", "Unknown")},
              {})
          .at(0);
  EXPECT_FALSE(row.answers);
  EXPECT_EQ(row.serial, "Unknown");
  EXPECT_EQ(targetMark({row}), '!');
  EXPECT_EQ(targetMark({row, lunRows({endpoint(LUN6)}, {}).at(0)}), '+');
}

TEST(LunsTest, OneKnownNameIsAnAnswer) {
  const char* const vendor = "ACME     Unknown Revision 1    Serial Number Unknown";
  const LunRow known = lunRows({endpoint(LUN5, vendor, "Unknown")}, {}).at(0);
  EXPECT_EQ(known.vendor, "ACME");
  EXPECT_EQ(known.revision, "1");
  EXPECT_TRUE(known.answers);
  const char* const model = "Unknown  ARRAY 7200       Revision 0410 Serial Number SN1";
  EXPECT_TRUE(lunRows({endpoint(LUN5, model)}, {}).at(0).answers);
}

TEST(LunsTest, OddInstancesAreLeftOutOrLeftBare) {
  Instance nameless;
  nameless.properties = {{"Name", Value::string("odd")}};
  EXPECT_TRUE(lunRows({nameless}, {nameless}).empty());
  Instance odd = device("", LUN5, 0);
  odd.properties.set("DeviceID", Value::string("a_b"));
  const LunRow row = lunRows({endpoint(LUN5, "no such form")}, {odd}).at(0);
  EXPECT_EQ(row.vendor, "");
  EXPECT_EQ(row.className, "");
}

TEST(LunsTest, LunsAreNumbersWhereTheirFormIsKnown) {
  const std::pair<const char*, const char*> forms[] = {
      {"00FF000000000000", "255"},
      {"4100000000000000", "256"},
      {"7FFF000000000000", "16383"},
      {"D200400000000000", "16384"},
      {"0005000100000000", "0005000100000000"},
      {"0105000000000000", "0105000000000000"},
      {"8005000000000000", "8005000000000000"},
      {"D200400000000001", "D200400000000001"},
      {"C101000000000000", "C101000000000000"},
      {"ZZ01000000000000", "ZZ01000000000000"},
  };
  for (const auto& [digits, number] : forms) {
    EXPECT_EQ(lunRows({endpoint(digits)}, {}).at(0).lun, number);
  }
}

TEST(LunsTest, CapacitiesAreInHumanUnits) {
  const std::pair<std::uint64_t, const char*> capacities[] = {
      {0, "0 B"},
      {512, "512 B"},
      {1023, "1023 B"},
      {1024, "1 KiB"},
      {1536, "1.5 KiB"},
      {107374181888, "100 GiB"},  // 100 GiB less a block
      {1048575, "1 MiB"},
      {17592186040320, "16 TiB"},
      {1649267441664, "1.5 TiB"},
      {18446744073709551615ULL, "16 EiB"},
  };
  for (const auto& [bytes, words] : capacities) EXPECT_EQ(capacityWords(bytes), words) << bytes;
}

TEST(LunsTest, TypesAreInWords) {
  EXPECT_EQ(deviceTypeWords(0), "disk");
  EXPECT_EQ(deviceTypeWords(8), "changer");
  EXPECT_EQ(deviceTypeWords(10), "type 0x0A");
  EXPECT_EQ(deviceTypeWords(13), "enclosure");
  EXPECT_EQ(deviceTypeWords(31), "type 0x1F");
}

TEST(LunsTest, TheTableSaysWhenThereIsNothing) {
  EXPECT_EQ(lunTable({}), "no logical units\n");
}

PortRow portInState(const char* state) {
  PortRow port;
  port.wwpn = "10:00:02:54:56:0C:30:01";
  port.state = state;
  return port;
}

TEST(LunsTest, MarksFollowTheState) {
  EXPECT_EQ(portMark(portInState("OK")), '+');
  EXPECT_EQ(portMark(portInState("In Service")), '+');
  EXPECT_EQ(portMark(portInState("Unknown")), '?');
  EXPECT_EQ(portMark(portInState("Link Down, Needs Reset")), '!');
  EXPECT_EQ(cardMark({"m", "s", {portInState("OK"), portInState("OK")}}), '+');
  EXPECT_EQ(cardMark({"m", "s", {portInState("Unknown"), portInState("Error")}}), '!');
  EXPECT_EQ(cardMark({"m", "s", {portInState("OK"), portInState("Unknown")}}), '?');
  EXPECT_EQ(cardMark({"m", "s", {}}), '?');
}

TEST(LunsTest, PortsAndCardsWithoutASerialNumberDoNotBelongTogether) {
  Instance port;
  port.properties = {{"DeviceID", Value::string(PORT)}};
  Instance card;
  card.properties = {{"Model", Value::string("TVX-1")}};
  const std::vector<CardNode> nodes = cardNodes({port}, {card});
  ASSERT_EQ(nodes.size(), 2U);
  EXPECT_EQ(nodes[0].model, "TVX-1");
  EXPECT_TRUE(nodes[0].ports.empty());
  EXPECT_EQ(nodes[1].model, "");
  ASSERT_EQ(nodes[1].ports.size(), 1U);
}

TEST(LunsTest, TheTreeMarksWhatDoesNotAnswer) {
  const auto rows = lunRows(
      {endpoint(LUN5, "Unknown Unknown Revision Unkn Serial Number Unknown", "Unknown")}, {});
  const std::string text = treeText("host-1", {{"TVX-1", "SN9", {portInState("OK")}}}, rows);
  EXPECT_NE(text.find("\n      ! target 50:0C:0F:F1:2A:00:10:01  0x010203\n"
                      "        ! LUN 5  no answer  /dev/sda\n"),
            std::string::npos)
      << text;
}

TEST(LunsTest, TheTreeIsIndented) {
  const auto rows = lunRows({endpoint(LUN5), endpoint(LUN6)}, {device("", LUN5, 0)});
  EXPECT_EQ(treeText("host-1", {{"TVX-1", "SN9", {portInState("OK")}}, {"", "", {}}}, rows),
            "host host-1\n"
            "  + card TVX-1  SN9\n"
            "    + port 10:00:02:54:56:0C:30:01  unknown  OK\n"
            "      + target 50:0C:0F:F1:2A:00:10:01  0x010203\n"
            "        + LUN 5  disk  ACMESTOR ARRAY 7200  1 GiB  /dev/sda\n"
            "        + LUN 6  ACMESTOR ARRAY 7200  /dev/sda\n"
            "  ? ports without a card\n");
  EXPECT_EQ(treeText("", {}, {}), "host (no adapters)\n");
}

}  // namespace
}  // namespace tvx::host
