// Port statistics, which move with time or by the script of the scenario.
#include "lrmapi/Call.h"

using namespace tvx::sim;

namespace {

std::uint64_t read_counter(Counter& counter, std::int64_t seconds) {
  if (!counter.script.empty()) {
    const std::size_t index = std::min(counter.reads++, counter.script.size() - 1);
    return counter.script[index];
  }
  if (counter.start == UINT64_MAX) return UINT64_MAX;  // the hardware has no such counter
  return counter.start +
         counter.per_second * static_cast<std::uint64_t>(std::max<std::int64_t>(seconds, 0));
}

}  // namespace

extern "C" {

RM_STATUS LRM_GetPortStatistics(HBA_WWN wwpn, void* block, uint32_t* size) {
  return port_call("LRM_GetPortStatistics", wwpn,
                   [=](const World& world, Port& port, const Fault_Effect& effect) {
                     const std::int64_t seconds = counter_seconds(world);
                     Attribute_Map values;
                     for (auto& [id, counter] : port.counters) {
                       values[id] = number64_value(read_counter(counter, seconds));
                     }
                     return answer_block(std::move(values), block, size, effect);
                   },
                   {.told = size});
}

}  // extern "C"
