#include "hbaapi/Call.h"

namespace tvx::sim {

Call_Site site_of(const Handle_Call& call) {
  return Simulation::instance().with_world([&call](const World& world) {
    Call_Site site{.name = call.name, .target = call.target, .lun = call.lun, .page = call.page};
    const auto found = world.handles.find(call.handle);
    if (found == world.handles.end()) return site;
    const Adapter& adapter = world.adapters[found->second];
    site.adapter = adapter.name;
    if (call.port_index && *call.port_index < adapter.ports.size()) {
      site.port = world.ports[adapter.ports[*call.port_index]].names.port;
    }
    return site;
  });
}

}  // namespace tvx::sim
