// Targets and logical units: mapping, SCSI commands, attributes.
#include <array>
#include <chrono>

#include "sim/Libraries.h"

namespace tvx::sim_test {
namespace {

constexpr const char* small_san = R"({
  "cards": [{"model": "TVX16001", "ports": [{
    "wwpn": "1000025456000001", "targets": [
      {"wwpn": "500C0FF000000001", "wwnn": "500C0FF000000000", "fc_id": "0x010100", "luns": [
        {"first": 0, "count": 2, "vendor": "VEND", "model": "DISK MODEL", "revision": "0007",
         "serial": "SER", "block_size": 4096, "blocks": 1000},
        {"first": 300, "type": "tape"},
        {"first": 301, "blocks": "0x200000000", "identifier": {"type": 2, "hex": "0102030405060708"}}
      ]},
      {"wwpn": "500C0FF000000002", "luns": {"first": 7, "type": 12, "pages": {"0x80": "0C80FFFF41"}}}
    ]}]}]
})";

constexpr std::uint64_t target = 0x500C0FF000000001ULL;
constexpr std::uint64_t second_target = 0x500C0FF000000002ULL;

// LUN bytes as an integer in memory order.
HBA_UINT64 fcp_lun(std::array<std::uint8_t, 8> bytes) {
  HBA_UINT64 lun;
  std::memcpy(&lun, bytes.data(), sizeof lun);
  return lun;
}

class San : public Simulated_Host {
 protected:
  San() {
    EXPECT_EQ(tvxsim_load_text(small_san), 0) << tvxsim_last_error();
    handle = open("Torvex-TVX16001-1");
  }

  HBA_FCPTARGETMAPPING* map(std::uint32_t room) {
    rows.assign(8 + room * sizeof(HBA_FCPSCSIENTRY), 0xEE);
    auto* mapping = reinterpret_cast<HBA_FCPTARGETMAPPING*>(rows.data());
    mapping->NumberOfEntries = room;
    status = SIM_CALL(hba, HBA_GetFcpTargetMapping, handle, mapping);
    return mapping;
  }

  HBA_STATUS inquire(std::uint64_t wwpn, HBA_UINT64 lun, HBA_UINT8 evpd, HBA_UINT32 page) {
    response.fill(0);
    sense.fill(0);
    return SIM_CALL(hba, HBA_SendScsiInquiry, handle, wwn(wwpn), lun, evpd, page, response.data(),
                    255u, sense.data(), 128u);
  }

  HBA_STATUS capacity(std::uint64_t wwpn, HBA_UINT64 lun) {
    response.fill(0);
    sense.fill(0);
    return SIM_CALL(hba, HBA_SendReadCapacity, handle, wwn(wwpn), lun, response.data(), 255u,
                    sense.data(), 128u);
  }

  std::string text(std::size_t offset, std::size_t length) {
    return {reinterpret_cast<const char*>(response.data()) + offset, length};
  }

  HBA_HANDLE handle = 0;
  HBA_STATUS status = 0;
  std::vector<std::uint8_t> rows;
  std::array<std::uint8_t, 256> response{};
  std::array<std::uint8_t, 128> sense{};
};

TEST_F(San, TheMappingHasARowForEachUnit) {
  const HBA_FCPTARGETMAPPING* mapping = map(256);
  ASSERT_EQ(status, 0u);
  ASSERT_EQ(mapping->NumberOfEntries, 5u);
  const HBA_FCPSCSIENTRY* row = mapping->entry;
  EXPECT_EQ(number(row[0].FcpId.PortWWN), target);
  EXPECT_EQ(number(row[0].FcpId.NodeWWN), 0x500C0FF000000000ULL);
  EXPECT_EQ(row[0].FcpId.FcId, 0x010100u);
  EXPECT_STREQ(row[0].ScsiId.OSDeviceName, "/dev/sda");
  EXPECT_EQ(row[1].FcpId.FcpLun, fcp_lun({0, 1}));
  EXPECT_STREQ(row[1].ScsiId.OSDeviceName, "/dev/sdb");
  EXPECT_EQ(row[2].FcpId.FcpLun, fcp_lun({0x41, 0x2C}));
  EXPECT_EQ(row[2].ScsiId.ScsiOSLun, 300u);
  EXPECT_STREQ(row[2].ScsiId.OSDeviceName, "/dev/st2");
  EXPECT_EQ(number(row[4].FcpId.PortWWN), second_target);
  EXPECT_EQ(row[4].ScsiId.ScsiTargetNumber, 1u);
}

TEST_F(San, UnitsAreNamedAsASystemWould) {
  ASSERT_EQ(tvxsim_load_text(R"({"cards": [{"model": "TVX16001", "ports": [{"targets": [
      {"wwpn": "500C0FF000000001", "luns": [{"count": 27}, {"first": 27, "type": "cdrom"},
        {"first": 28, "type": "array"}, {"first": 29, "os_device": "/dev/mine"}]}]}]}]})"),
            0)
      << tvxsim_last_error();
  handle = open("Torvex-TVX16001-1");
  const HBA_FCPSCSIENTRY* row = map(256)->entry;
  EXPECT_STREQ(row[25].ScsiId.OSDeviceName, "/dev/sdz");
  EXPECT_STREQ(row[26].ScsiId.OSDeviceName, "/dev/sdaa");
  EXPECT_STREQ(row[27].ScsiId.OSDeviceName, "/dev/sr27");
  EXPECT_STREQ(row[28].ScsiId.OSDeviceName, "/dev/sg28");
  EXPECT_STREQ(row[29].ScsiId.OSDeviceName, "/dev/mine29");
}

TEST_F(San, EachPortIsABusOfItsAdapter) {
  ASSERT_EQ(tvxsim_load_text(R"({"cards": [{"model": "TVX16001", "adapter_per": "card", "ports": [
      {"targets": [{"wwpn": "500C0FF000000001", "luns": {"count": 1}}]},
      {"targets": [{"wwpn": "500C0FF000000002", "luns": {"count": 1}}]}]}]})"),
            0)
      << tvxsim_last_error();
  handle = open("Torvex-TVX16001-1");
  const HBA_FCPTARGETMAPPING* mapping = map(256);
  ASSERT_EQ(mapping->NumberOfEntries, 2u);
  const HBA_FCPSCSIENTRY* row = mapping->entry;
  EXPECT_EQ(row[0].ScsiId.ScsiBusNumber, 0u);
  EXPECT_EQ(row[1].ScsiId.ScsiBusNumber, 1u);
  EXPECT_EQ(number(row[1].FcpId.PortWWN), second_target);
}

TEST_F(San, AMappingMayTellAnotherCountThanItsOwn) {
  fault(R"({"call": "HBA_GetFcpTargetMapping", "returned_size": 300})");
  EXPECT_EQ(map(256)->NumberOfEntries, 300u);
  EXPECT_EQ(status, 0u);
}

TEST_F(San, AMappingWithoutRoomTellsTheNeedAndFillsWhatThereIs) {
  const HBA_FCPTARGETMAPPING* mapping = map(2);
  EXPECT_EQ(status, HBA_STATUS_ERROR_MORE_DATA + 0u);
  EXPECT_EQ(mapping->NumberOfEntries, 5u);
  EXPECT_EQ(number(mapping->entry[0].FcpId.PortWWN), target);
}

TEST_F(San, AGrowingMappingIsAFaultWithItsOwnCounts) {
  fault(R"({"call": "HBA_GetFcpTargetMapping", "status": 7, "returned_size": 300, "nth": 1})");
  fault(R"({"call": "HBA_GetFcpTargetMapping", "status": 7, "returned_size": 600, "from": 2})");
  EXPECT_EQ(map(256)->NumberOfEntries, 300u);
  EXPECT_EQ(status, 7u);
  EXPECT_EQ(map(300)->NumberOfEntries, 600u);
  EXPECT_EQ(status, 7u);
}

TEST_F(San, APortWithoutLinkSeesNothing) {
  std::uint8_t result = 0;
  ASSERT_EQ(SIM_CALL(rm, LRM_SetPortEnabled, wwn(0x1000025456000001ULL), 0, &result), 0);
  EXPECT_EQ(map(16)->NumberOfEntries, 0u);
  EXPECT_EQ(status, 0u);
}

TEST_F(San, StandardInquiryTellsTypeAndTexts) {
  ASSERT_EQ(inquire(target, fcp_lun({0, 1}), 0, 0), 0u);
  EXPECT_EQ(response[0], 0);
  EXPECT_EQ(text(8, 8), "VEND    ");
  EXPECT_EQ(text(16, 16), "DISK MODEL      ");
  EXPECT_EQ(text(32, 4), "0007");
  ASSERT_EQ(inquire(target, fcp_lun({0x41, 0x2C}), 0, 0), 0u);
  EXPECT_EQ(response[0] & 0x1F, 1);
}

TEST_F(San, PagesTellSerialNumberAndIdentification) {
  ASSERT_EQ(inquire(target, fcp_lun({0, 1}), 1, 0x80), 0u);
  EXPECT_EQ(response[1], 0x80);
  EXPECT_STREQ(reinterpret_cast<const char*>(response.data() + 4), "SER000001");
  ASSERT_EQ(inquire(target, fcp_lun({0, 1}), 1, 0x83), 0u);
  EXPECT_EQ(response[1], 0x83);
  EXPECT_EQ(response[3], 20);
  EXPECT_EQ(response[5], 3);
  EXPECT_EQ(response[7], 16);
  EXPECT_EQ(response[8] >> 4, 6);
  EXPECT_EQ(response[23], 1);
  ASSERT_EQ(inquire(target, fcp_lun({0x41, 0x2D}), 1, 0x83), 0u);
  EXPECT_EQ(response[5], 2);
  EXPECT_EQ(response[7], 8);
  EXPECT_EQ(response[15], 8);
}

TEST_F(San, APageOfTheScenarioIsAnsweredAsItStands) {
  ASSERT_EQ(inquire(second_target, fcp_lun({0, 7}), 1, 0x80), 0u);
  EXPECT_EQ(text(2, 3),
            "\xFF\xFF"
            "A");
}

TEST_F(San, AnUnknownPageIsACheckConditionWithSense) {
  EXPECT_EQ(inquire(target, fcp_lun({0, 0}), 1, 0xC0), HBA_STATUS_SCSI_CHECK_CONDITION + 0u);
  EXPECT_EQ(sense[0], 0x70);
  EXPECT_EQ(sense[2], 5);
  EXPECT_EQ(sense[12], 0x24);
}

TEST_F(San, UnknownTargetsAndUnitsAreRefused) {
  EXPECT_EQ(inquire(0x1234, fcp_lun({0, 0}), 0, 0), 27u);
  EXPECT_EQ(inquire(target, fcp_lun({0, 9}), 0, 0), 14u);
  EXPECT_EQ(inquire(target, fcp_lun({0x80, 9, 1}), 0, 0), 14u);
}

TEST_F(San, CapacityIsBigEndianAndMayBeMissing) {
  ASSERT_EQ(capacity(target, fcp_lun({0, 0})), 0u);
  EXPECT_EQ(text(0, 8), std::string("\0\0\x03\xE7\0\0\x10\0", 8));
  EXPECT_EQ(capacity(target, fcp_lun({0x41, 0x2C})), HBA_STATUS_SCSI_CHECK_CONDITION + 0u);
  EXPECT_EQ(sense[2], 2);
  EXPECT_EQ(sense[12], 0x3A);
  ASSERT_EQ(capacity(target, fcp_lun({0x41, 0x2D})), 0u);
  EXPECT_EQ(text(0, 4), "\xFF\xFF\xFF\xFF");
  EXPECT_EQ(text(8, 8), std::string("\0\0\0\x01\xFF\xFF\xFF\xFF", 8));
}

TEST_F(San, OneCommandOfOneUnitCanFailWithItsSense) {
  fault(R"({"call": "HBA_SendScsiInquiry", "status": 9, "sense": "70 00 06", "lun": 1,
            "page": "0x83", "target": "500C0FF000000001", "first": 2})");
  EXPECT_EQ(inquire(target, fcp_lun({0, 1}), 0, 0), 0u);
  EXPECT_EQ(inquire(target, fcp_lun({0, 0}), 1, 0x83), 0u);
  EXPECT_EQ(inquire(target, fcp_lun({0, 1}), 1, 0x83), 9u);
  EXPECT_EQ(sense[2], 6);
  EXPECT_EQ(inquire(target, fcp_lun({0, 1}), 1, 0x83), 9u);
  EXPECT_EQ(inquire(target, fcp_lun({0, 1}), 1, 0x83), 0u);
}

TEST_F(San, IdentifiersAreOfAnyTypeAndLength) {
  ASSERT_EQ(tvxsim_load_text(R"({"cards": [{"model": "TVX16001", "ports": [{"targets": [
      {"wwpn": "500C0FF000000001", "luns": [
        {"first": 0, "identifier": {"type": 15, "length": 255, "hex": "AB"}},
        {"first": 1, "identifier": {"type": 0, "length": 0}},
        {"first": 2, "identifier": {"type": 8, "code_set": 3, "hex": "6971"}}]}]}]}]})"),
            0)
      << tvxsim_last_error();
  handle = open("Torvex-TVX16001-1");
  ASSERT_EQ(inquire(target, fcp_lun({0, 0}), 1, 0x83), 0u);
  EXPECT_EQ(response[5], 15);
  EXPECT_EQ(response[7], 255);
  EXPECT_EQ(response[8], 0xAB);
  EXPECT_EQ(response[2] * 256 + response[3], 4 + 255);
  ASSERT_EQ(inquire(target, fcp_lun({0, 1}), 1, 0x83), 0u);
  EXPECT_EQ(response[5], 0);
  EXPECT_EQ(response[7], 0);
  ASSERT_EQ(inquire(target, fcp_lun({0, 2}), 1, 0x83), 0u);
  EXPECT_EQ(response[4], 3);
  EXPECT_EQ(text(8, 2), "iq");
}

TEST_F(San, APageLongerThanTheRoomIsCutToTheRoom) {
  std::string page;
  for (int i = 0; i < 300; i++) page += "5A";
  ASSERT_EQ(tvxsim_load_text((R"({"cards": [{"model": "TVX16001", "ports": [{"targets": [
      {"wwpn": "500C0FF000000001", "luns": {"pages": {"0x83": ")" +
                              page + R"("}}}]}]}]})")
                                 .c_str()),
            0)
      << tvxsim_last_error();
  handle = open("Torvex-TVX16001-1");
  ASSERT_EQ(inquire(target, fcp_lun({0, 0}), 1, 0x83), 0u);
  EXPECT_EQ(response[254], 0x5A);
  EXPECT_EQ(response[255], 0) << "one behind the room that the library was told";
}

TEST_F(San, AMappingCanStayStale) {
  fault(R"({"call": "HBA_GetFcpTargetMapping", "status": 8})");
  for (int tries = 0; tries < 3; tries++) {
    EXPECT_EQ(map(256)->NumberOfEntries, 256u) << "the room stays as it was told";
    EXPECT_EQ(status, HBA_STATUS_ERROR_STALE_DATA + 0u);
    SIM_CALL(hba, HBA_RefreshInformation, handle);
  }
}

TEST_F(San, ADelayIsThatOfOneCommandOfOneUnit) {
  fault(R"({"call": "HBA_SendScsiInquiry", "lun": 1, "page": "0x83", "delay_ms": 20})");
  using Clock = std::chrono::steady_clock;
  const auto start = Clock::now();
  EXPECT_EQ(inquire(target, fcp_lun({0, 1}), 1, 0x83), 0u);
  EXPECT_GE(Clock::now() - start, std::chrono::milliseconds(20));
  EXPECT_EQ(response[1], 0x83) << "the answer is the same";
}

TEST_F(San, OneElementMakesManyTargets) {
  ASSERT_EQ(tvxsim_load_text(R"({"cards": [{"model": "TVX16001", "ports": [{"targets": [
      {"wwpn": "500C0FF0000000FE", "wwnn": "500C0FF000000000", "fc_id": "0x010100", "count": 3,
       "luns": [{"first": 0, "count": 2}, {"first": 9, "type": 12}]}]}]}]})"),
            0)
      << tvxsim_last_error();
  handle = open("Torvex-TVX16001-1");
  const HBA_FCPTARGETMAPPING* mapping = map(256);
  ASSERT_EQ(mapping->NumberOfEntries, 9u);
  const HBA_FCPSCSIENTRY& last = mapping->entry[8];
  EXPECT_EQ(number(last.FcpId.PortWWN), 0x500C0FF000000100ULL);
  EXPECT_EQ(number(last.FcpId.NodeWWN), 0x500C0FF000000000ULL);
  EXPECT_EQ(last.FcpId.FcId, 0x010102u);
  EXPECT_EQ(last.ScsiId.ScsiTargetNumber, 2u);
  EXPECT_EQ(inquire(0x500C0FF0000000FFULL, fcp_lun({0, 9}), 0, 0), 0u);
  EXPECT_EQ(response[0], 12);
  EXPECT_EQ(inquire(0x500C0FF000000101ULL, fcp_lun({0, 9}), 0, 0), 27u);
  EXPECT_NE(tvxsim_load_text(R"({"cards": [{"ports": [{"targets": [
      {"wwpn": "500C0FF0000000FE", "count": 0}]}]}]})"),
            0);
  EXPECT_NE(std::string(tvxsim_last_error()).find("/targets/0/count: counts from 1"),
            std::string::npos)
      << tvxsim_last_error();
}

TEST_F(San, AHundredThousandUnitsAreMapped) {
  ASSERT_EQ(tvxsim_load_text(R"({"cards": [{"model": "TVX16001", "ports": [{"targets": [
      {"wwpn": "500C0FF000000001", "luns": {"count": 100000}}]}]}]})"),
            0)
      << tvxsim_last_error();
  handle = open("Torvex-TVX16001-1");
  const HBA_FCPTARGETMAPPING* mapping = map(100000);
  ASSERT_EQ(status, 0u);
  EXPECT_EQ(mapping->NumberOfEntries, 100000u);
  EXPECT_EQ(mapping->entry[99999].FcpId.FcpLun, fcp_lun({0xD2, 0x01, 0x86, 0x9F}));
  EXPECT_EQ(inquire(target, fcp_lun({0xD2, 0x01, 0x86, 0x9F}), 0, 0), 0u);
}

TEST_F(San, TheManagementLibraryTellsTheSame) {
  const HBA_WWN port = wwn(0x1000025456000001ULL);
  Block block(rm, 4096);
  ASSERT_EQ(SIM_CALL(rm, LRM_GetLunAttributes, port, wwn(target), 1ull, block.data(), &block.size),
            0);
  EXPECT_EQ(block.text(RM_LA_DEVICE_NAME), "/dev/sdb");
  EXPECT_EQ(block.u32(RM_LA_BLOCK_SIZE), 4096u);
  EXPECT_EQ(block.u64(RM_LA_LAST_LBA), 999u);
  EXPECT_EQ(block.length(RM_LA_INQUIRY), 96u);
  EXPECT_EQ(block.length(RM_LA_READ_CAPACITY), 8u);
  EXPECT_EQ(SIM_CALL(rm, LRM_ScsiInquiry, port, wwn(target), 1ull, response.data(), 255u,
                     sense.data(), 128u),
            0);
  EXPECT_EQ(text(8, 4), "VEND");
  EXPECT_EQ(SIM_CALL(rm, LRM_ScsiReadCapacity, port, wwn(target), 300ull, response.data(), 32u,
                     sense.data(), 128u),
            RM_ERROR_SCSI_CHECK);
  EXPECT_EQ(sense[12], 0x3A);
  rows.assign(8 + 5 * sizeof(HBA_FCPSCSIENTRY), 0);
  auto* mapping = reinterpret_cast<HBA_FCPTARGETMAPPING*>(rows.data());
  mapping->NumberOfEntries = 1;
  EXPECT_EQ(SIM_CALL(rm, LRM_GetFcpTargetMapping, port, mapping), RM_ERROR_MORE_DATA);
  EXPECT_EQ(mapping->NumberOfEntries, 5u);
}

TEST_F(San, TheUnitListHasRoomForWhatItTells) {
  std::vector<std::uint64_t> memory(16);
  auto* list = reinterpret_cast<RM_LunList*>(memory.data());
  list->count = 1;
  const HBA_WWN port = wwn(0x1000025456000001ULL);
  EXPECT_EQ(SIM_CALL(rm, LRM_GetLunList, port, wwn(target), 0u, list), RM_ERROR_MORE_DATA);
  EXPECT_EQ(list->count, 4u);
  EXPECT_EQ(SIM_CALL(rm, LRM_GetLunList, port, wwn(target), 0u, list), 0);
  const RM_LunEntry* entries = list->entry;
  EXPECT_EQ(entries[1].lunLow, 1u);
  EXPECT_EQ(entries[1].osLunValid, 1);
  EXPECT_EQ(entries[1].osLun, 1);
  EXPECT_EQ(entries[2].lunLow, 300u);
  EXPECT_EQ(entries[2].osLunValid, 0);
}

}  // namespace
}  // namespace tvx::sim_test
