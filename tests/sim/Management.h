// The fixture of the tests of what management can read and change.
#pragma once

#include <string>

#include "sim/Libraries.h"

namespace tvx::sim_test {

inline const HBA_WWN second_port = wwn(0x10000254560C4111ULL);

/// The default host, or a port of the test's own, with what its attributes tell.
class Management : public Simulated_Host {
 protected:
  void load_port(const std::string& members) {
    const std::string text =
        R"({"cards": [{"model": "TVX16001", "ports": [{"wwpn": "10000254560C4110")" +
        (members.empty() ? "" : ", " + members) + "}]}]}";
    ASSERT_EQ(tvxsim_load_text(text.c_str()), 0) << tvxsim_last_error();
  }

  std::uint32_t adapter_number(std::uint32_t id) {
    Block block(rm);
    EXPECT_EQ(SIM_CALL(rm, LRM_GetHBAAttributes, first_port, block.data(), &block.size), 0);
    return block.u32(id);
  }
  std::string adapter_text(std::uint32_t id, const HBA_WWN& port = first_port) {
    Block block(rm);
    EXPECT_EQ(SIM_CALL(rm, LRM_GetHBAAttributes, port, block.data(), &block.size), 0);
    return block.text(id);
  }
  std::uint32_t port_number(std::uint32_t id) {
    Block block(rm, 2048);
    EXPECT_EQ(SIM_CALL(rm, LRM_GetPortAttributes, first_port, block.data(), &block.size), 0);
    return block.u32(id);
  }
};

}  // namespace tvx::sim_test
