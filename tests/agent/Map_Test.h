// What the tests of the adapter maps share: a host, and ways to look at instances.
#pragma once

#include <string>
#include <vector>

#include "Agent_Fixture.h"
#include "agent/MapBuild.h"
#include "model/TVX_Data.h"

namespace cimrt::test {

/// Two cards of two ports, the second with a sub-adapter and a port without link, and a converged
/// card that discovery drops. Every value that a test looks at is stated.
inline constexpr const char* TWO_CARDS = R"({"cards": [
  {"model": "TVX16002", "manufacturer": "Torvex Corporation", "serial_number": "TX52100417",
   "model_description": "Torvex TVX16002 2-Port 16Gb PCIe Fibre Channel Adapter",
   "hardware_version": "0000000b", "node_symbolic_name": "Torvex TVX16002 FV2.01a4",
   "firmware_version": "2.01a4", "vendor_specific_id": 3791658395, "device_id": "0xE300",
   "model_id": "0xE312", "sli_mode": 4,
   "ports": [
     {"wwpn": "10000254560C4110", "wwnn": "20000254560C4110", "fc_id": "0x010400",
      "fabric_name": "100000054D5A8001", "state": "online", "speed": "16G", "type": "n",
      "supported_speed": "0x38", "max_frame_size": 2048, "class_of_service": 8,
      "discovered_ports": 2, "fec_state": "on"},
     {"wwpn": "10000254560C4111", "wwnn": "20000254560C4111"}]},
  {"model": "TVX8102", "manufacturer": "Torvex Corporation", "serial_number": "TX48007733",
   "model_description": "Torvex TVX8102 2-Port 8Gb PCIe Fibre Channel Adapter",
   "node_symbolic_name": "Torvex TVX8102 FV1.12a7", "device_id": "0xE200",
   "sub_adapter_id": "1", "board_temperature": {"current": 51, "critical": 85, "warning": 75},
   "ports": [
     {"wwpn": "10000254560A7E20", "wwnn": "20000254560A7E20", "symbolic_name": "port zero",
      "os_device_name": "/sys/class/scsi_host/host2"},
     {"wwpn": "10000254560A7E21", "wwnn": "20000254560A7E21", "type": "unknown",
      "fabric_name": "0000000000000000", "state": "link down", "speed": "unknown"}]},
  {"adapter_name": "Torvex-OCN11102", "serial_number": "DROPPED", "ports": [{}]}]})";

class Adapter_Maps : public Agent_Test {
 protected:
  ProviderAgent& build(const std::string& scenario = TWO_CARDS) {
    useScenario(scenario);
    return rebuild();
  }
  /// The same on the scenario in use, faults included.
  ProviderAgent& rebuild() {
    ProviderAgent& agent = startAgent();
    refresh(agent);
    return agent;
  }
};

/// An adapter of no class that the builders know, which says that it is an FC adapter.
class Odd_Adapter : public Adapter {
 public:
  Odd_Adapter() : Adapter("odd", 0, TVX_ADAPTER_TYPE_FC) {}
  const std::string& getName() const override { return m_Name; }
  const std::int32_t& getNumber() const override { return m_Number; }
  const std::uint32_t& getFunctionType() const override { return m_FunctionType; }
  AdapterAttributes* getAttributes() override { return nullptr; }
  AdapterStatistics* getStatistics() override { return nullptr; }
  std::size_t getNumberOfPorts() override { return 0; }
  std::vector<Port*>& getPorts() override { return m_Ports; }
  Port* getPort(int) override { return nullptr; }
  void rescanTargets() override {}
};

inline std::string text(const Property<String>& property) {
  return property.is_null() ? "(null)" : property.value.c_str();
}

inline std::vector<std::string> texts(const Property<Array<String>>& property) {
  std::vector<std::string> result;
  for (const String& value : property.value) result.emplace_back(value.c_str());
  return result;
}

template <class T>
std::vector<T> numbers(const Property<Array<T>>& property) {
  return {property.value.begin(), property.value.end()};
}

/// True if the two references of an association lead to these instances, in this order.
template <class T>
bool ties(const T& association, const Instance* first, const Instance* second) {
  const Instance* ends[2] = {first, second};
  std::size_t found = 0;
  for (std::uint64_t i = 0; i < T::static_meta_class.num_meta_features && found < 2; i++) {
    const Meta_Feature* feature = T::static_meta_class.meta_features[i];
    if (!is_reference(feature)) continue;
    const auto* end = *static_cast<Instance* const*>(storage(&association, feature));
    if (!end || !identical(end, ends[found])) return false;
    found++;
  }
  return found == 2;
}

}  // namespace cimrt::test
