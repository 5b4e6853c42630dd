#include "hbaapi/Call.h"

namespace tvx::sim {

Call_Site site_of(const char* name, HBA_HANDLE handle, std::optional<HBA_UINT32> port_index) {
  return Simulation::instance().with_world([&](const World& world) {
    Call_Site site{.name = name};
    const auto found = world.handles.find(handle);
    if (found == world.handles.end()) return site;
    const Adapter& adapter = world.adapters[found->second];
    site.adapter = adapter.name;
    if (port_index && *port_index < adapter.ports.size()) {
      site.port = world.ports[adapter.ports[*port_index]].names.port;
    }
    return site;
  });
}

}  // namespace tvx::sim
