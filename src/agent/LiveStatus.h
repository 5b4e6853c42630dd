// What moves between two refreshes: link status and counters of the ports.
//
// The updates are handed to the active enumeration, which runs them with the agent's data lock and
// the class's own lock held. Each asks the hardware at most once in ten seconds, a failed run
// counting as one. A port that can't be read ends the run with `std::exception`: its values and
// those of the ports after it stay as they were.
#pragma once

#include "agent/ProviderAgent.h"
#include "generated/Records.h"
#include "model/TVX_Data.h"

namespace cimrt {

/// Takes the counters of every port over to its `TVXHBA_FCPortStatistics`.
void GetFCPortStats(ProviderAgent& agent);

/// Takes status, type, names and speed of every port over to its `TVXHBA_FCPort`.
void UpdateFCPortStatus(ProviderAgent& agent);

/// The properties of a port that follow its link.
void setLinkState(TVXHBA_FCPort& port, const FCPortAttributes& from);

/// The ports of the FC adapters in the order of the device tree; others are skipped with a message.
/// `visit` gets the adapter and the port, and answers whether the walk goes on. The caller holds
/// the data lock.
template <class Visit>
void forEachFCPort(ProviderAgent& agent, Visit visit) {
  for (Adapter* adapter : agent.m_pData->m_Adapters) {
    if (adapter->m_Type != TVX_ADAPTER_TYPE_FC) {
      TVX_LOG(TVX_DBG, "Skippping Adapter [%s] since it is not an FC Adapter",
              adapter->getName().c_str());
      continue;
    }
    for (Port* port : adapter->getPorts())
      if (!visit(*adapter, *port)) return;
  }
}

/// The first entry of `map` whose text property contains `part`, or null.
template <class T>
T* findContaining(Instance_Map<T>& map, Property<String> T::*property, const std::string& part) {
  for (std::size_t i = 0; i < map.size(); i++) {
    const Property<String>& value = map[i]->*property;
    if (!value.is_null() && std::string_view(value.value.c_str()).find(part) != std::string::npos)
      return map[i];
  }
  return nullptr;
}

}  // namespace cimrt
