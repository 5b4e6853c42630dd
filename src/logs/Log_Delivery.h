// What the enumerations of log records have in common.
#pragma once

#include <utility>
#include <vector>

#include "agent/Map_Insert.h"

namespace cimrt {

/// Instances made under the agent's data lock, to be delivered outside it. Owns them.
class Log_Instances {
 public:
  /// The result of a request that made nothing because something failed.
  static Log_Instances failed() {
    Log_Instances none;
    none.m_bComplete = false;
    return none;
  }

  void add(Ref<Instance> instance) { m_Instances.push_back(std::move(instance)); }
  bool isComplete() const { return m_bComplete; }

  /// Hands each instance over until the handler wants no more. Once.
  void deliver(const Instance_Handler& handler) {
    for (Ref<Instance>& instance : m_Instances)
      if (!handler.handle(instance.release())) return;
  }

 private:
  std::vector<Ref<Instance>> m_Instances;
  bool m_bComplete = true;
};

/// True if the agent's libraries are open; otherwise the class is empty, and that is logged.
inline bool logsAreServed(const ProviderAgent& agent, const char* className) {
  if (agent.isLoaded()) return true;
  TVX_LOG(TVX_DBG, "RM Init failed for %s_Provider.cpp", className);
  return false;
}

/// Waits for the adapter maps and calls `work` with the data lock held.
template <class Work>
auto underDataLock(ProviderAgent& agent, Work work) {
  agent.awaitAdapterMaps();
  Ranked_Lock data(agent.m_DataMutex);
  return work();
}

/// Puts the names of its log into a record; they stay unset without a log.
template <class Entry>
void nameLog(Entry& entry, const TVXHBA_RecordLog* log) {
  if (!log) return;
  entry.LogInstanceID = log->InstanceID;
  entry.LogName = log->ElementName;
  entry.ElementName = log->ElementName;
}

}  // namespace cimrt
