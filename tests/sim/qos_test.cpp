// The frame tagging library, and port events.
#include "sim/Libraries.h"

namespace tvx::sim_test {
namespace {

class Tagging : public Simulated_Host {
 protected:
  Library qos{TVXSIM_TVSDM};
};

TEST_F(Tagging, FlagAndTableBelongToTheAdapter) {
  EXPECT_EQ(SIM_CALL(qos, CPQFC_LoadLibrary), 0);
  EXPECT_EQ(SIM_CALL(qos, CPQFC_GetNumberOfAdapters), 5u);
  const HBA_HANDLE handle = SIM_CALL(qos, CPQFC_OpenAdapter, "Torvex-TVX16002-1");
  ASSERT_NE(handle, 0u);
  std::uint32_t flag = 9;
  EXPECT_EQ(SIM_CALL(qos, CPQFC_QoSGetGlobalFlag, handle, &flag), 0);
  EXPECT_EQ(flag, 0u);
  EXPECT_EQ(SIM_CALL(qos, CPQFC_QoSSetGlobalFlag, handle, 1u), 0);
  EXPECT_EQ(SIM_CALL(qos, CPQFC_QoSGetGlobalFlag, handle, &flag), 0);
  EXPECT_EQ(flag, 1u);
  const HBA_HANDLE other = SIM_CALL(qos, CPQFC_OpenAdapter, "Torvex-TVX16002-2");
  EXPECT_EQ(SIM_CALL(qos, CPQFC_QoSGetGlobalFlag, other, &flag), 0);
  EXPECT_EQ(flag, 0u);
  SIM_CALL(qos, CPQFC_CloseAdapter, handle);
  EXPECT_NE(SIM_CALL(qos, CPQFC_QoSGetGlobalFlag, handle, &flag), 0);
  EXPECT_EQ(SIM_CALL(qos, CPQFC_OpenAdapter, "Torvex-Nothing"), 0u);
  EXPECT_EQ(SIM_CALL(qos, CPQFC_FreeLibrary), 0);
}

TEST_F(Tagging, ATableIsReadBackAsItWasSet) {
  const HBA_HANDLE handle = SIM_CALL(qos, CPQFC_OpenAdapter, "Torvex-TVX16002-1");
  std::vector<std::uint8_t> memory(4 + 2 * sizeof(CPQFC_QoSEntry));
  auto* table = reinterpret_cast<CPQFC_QoSTable*>(memory.data());
  EXPECT_EQ(SIM_CALL(qos, CPQFC_QoSGetConfig, handle, table), 0);
  EXPECT_EQ(table->numberOfEntries, 0u);
  CPQFC_QoSEntry entry{};
  entry.source = first_port;
  entry.target = wwn(0x500C0FF12A001001ULL);
  entry.tag = 44;
  std::memcpy(memory.data() + 4 + sizeof entry, &entry, sizeof entry);
  table->numberOfEntries = 2;
  EXPECT_EQ(SIM_CALL(qos, CPQFC_QoSSetConfig, handle, table), 0);
  memory.assign(memory.size(), 0);
  EXPECT_EQ(SIM_CALL(qos, CPQFC_QoSGetConfig, handle, table), 0);
  EXPECT_EQ(table->numberOfEntries, 2u);
  EXPECT_EQ(memory[4 + sizeof entry + 32], 0);
  EXPECT_EQ(SIM_CALL(qos, CPQFC_QoSGetConfig, handle, table), 0);
  EXPECT_EQ(std::memcmp(memory.data() + 4 + sizeof entry, &entry, sizeof entry), 0);
  table->numberOfEntries = 1;
  EXPECT_NE(SIM_CALL(qos, CPQFC_QoSGetConfig, handle, table), 0);
}

struct Seen {
  int count = 0;
  HBA_UINT32 type = 0;
};

void note(void* data, HBA_WWN, HBA_UINT32 type, HBA_UINT32) {
  auto* seen = static_cast<Seen*>(data);
  ++seen->count;
  seen->type = type;
}

TEST_F(Tagging, PortEventsReachTheCallbacksOfTheirPort) {
  Seen seen;
  HBA_CALLBACKHANDLE callback = nullptr;
  const HBA_HANDLE handle = open("Torvex-TVX16002-1");
  ASSERT_EQ(
      SIM_CALL(hba, HBA_RegisterForAdapterPortEvents, note, &seen, handle, first_port, &callback),
      0u);
  EXPECT_EQ(SIM_CALL(hba, HBA_RegisterForAdapterPortEvents, note, &seen, handle, wwn(3), &callback),
            HBA_STATUS_ERROR_ILLEGAL_WWN + 0u);
  EXPECT_EQ(tvxsim_post_event("10000254560C4110", 0x201, 0), 1);
  EXPECT_EQ(tvxsim_post_event("10000254560C4111", 0x201, 0), 0);
  EXPECT_EQ(tvxsim_post_event("nonsense", 0x201, 0), -1);
  EXPECT_EQ(seen.count, 1);
  EXPECT_EQ(seen.type, 0x201u);
  EXPECT_EQ(SIM_CALL(hba, HBA_RemoveCallback, callback), 0u);
  EXPECT_EQ(SIM_CALL(hba, HBA_RemoveCallback, callback), HBA_STATUS_ERROR_INVALID_HANDLE + 0u);
  EXPECT_EQ(tvxsim_post_event("10000254560C4110", 0x201, 0), 0);
}

}  // namespace
}  // namespace tvx::sim_test
