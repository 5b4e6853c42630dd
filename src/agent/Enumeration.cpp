// How class providers are answered: the three forms of enumeration, and the wait of a writer.
#include "agent/ProviderAgent.h"

namespace cimrt {

namespace {

/// Clones every entry of `map` into `local`. False, with a message, if a clone is refused.
bool copyEntries(const Instance_Map_Base& map, Instance_Map_Base& local) {
  local.reserve(map.size());
  for (std::size_t i = 0; i < map.size(); i++) {
    Ref<Instance> copy(clone(map.at(i)));
    if (local.take(copy) == Instance_Map_Base::npos) {
      TVX_LOG(TVX_CRIT, "Insert failed for %zu", i);
      return false;
    }
  }
  return true;
}

}  // namespace

void ProviderAgent::enumPlain(Instance_Map_Base& map, const Instance_Handler& handler) {
  BuildCimrtInfo();
  Instance_Map_Base local(map.meta_class());
  try {
    {
      Ranked_Lock mapsReady(m_AdapterMapsReadyMutex);
      m_AdapterMapsReadyCond.wait_until(m_AdapterMapsReadyMutex,
                                        [this] { return m_bIsAdapterMapsReady.load(); });
      Ranked_Lock data(m_DataMutex);
      if (!copyEntries(map, local)) return;
    }
    local.drain(handler);
  } catch (...) {
    TVX_LOG(TVX_CRIT, "Exception in CIM Provider Enumeration - do nothing");
  }
}

void ProviderAgent::enumActive(Instance_Map_Base& map, const Instance_Handler& handler,
                               Live_Update update, Ranked_Mutex& classMutex) {
  BuildCimrtInfo();
  Instance_Map_Base local(map.meta_class());
  try {
    {
      Ranked_Lock dataReady(m_AdapterDataReadyMutex);
      m_AdapterDataReadyCond.wait_until(m_AdapterDataReadyMutex,
                                        [this] { return m_bIsAdapterDataReady.load(); });
      Ranked_Lock mapsReady(m_AdapterMapsReadyMutex);
      m_AdapterMapsReadyCond.wait_until(m_AdapterMapsReadyMutex,
                                        [this] { return m_bIsAdapterMapsReady.load(); });
      Ranked_Lock data(m_DataMutex);
      {
        Ranked_Lock onePerClass(classMutex);
        update(*this);
      }
      if (!copyEntries(map, local)) return;
    }
    local.drain(handler);
  } catch (...) {
    TVX_LOG(TVX_CRIT, "Exception in Active CIM Provider Enumeration - do nothing");
  }
}

std::uint64_t ProviderAgent::askForSANMaps() {
  Ranked_Lock sanReady(m_SANMapsReadyMutex);
  if (!m_bIsSANMapsReady) m_bSANRefreshPending = true;
  return m_EndedRuns;
}

void ProviderAgent::enumSAN(Instance_Map_Base& map, const Instance_Handler& handler) {
  Instance_Map_Base local(map.meta_class());
  try {
    // A run that was under way, or fell due just now, may leave the SAN maps stale again: then the
    // request is made anew. So the wait ends with ready maps or with the end of a run.
    for (bool served = false; !served;) {
      const std::uint64_t seen = askForSANMaps();
      BuildCimrtInfo();
      Ranked_Lock sanReady(m_SANMapsReadyMutex);
      m_SANMapsReadyCond.wait_until(m_SANMapsReadyMutex, [this, seen] {
        return m_bIsSANMapsReady.load() || m_EndedRuns != seen;
      });
      if (!m_bIsSANMapsReady) continue;
      Ranked_Lock data(m_DataMutex);
      if (!copyEntries(map, local)) return;
      served = true;
    }
    local.drain(handler);
  } catch (...) {
    TVX_LOG(TVX_CRIT, "Exception in SAN CIM Provider Enumeration - do nothing");
  }
}

void ProviderAgent::awaitAdapterMaps() {
  BuildCimrtInfo();
  {
    Ranked_Lock dataReady(m_AdapterDataReadyMutex);
    if (!m_bIsAdapterDataReady) {
      TVX_LOG(TVX_DBG, "PERF: Waiting for m_AdapterDataReadyMutex");
      m_AdapterDataReadyCond.wait_until(m_AdapterDataReadyMutex,
                                        [this] { return m_bIsAdapterDataReady.load(); });
      TVX_LOG(TVX_DBG, "PERF: Woken up from wait for m_AdapterDataReadyMutex");
    }
  }
  Ranked_Lock mapsReady(m_AdapterMapsReadyMutex);
  if (!m_bIsAdapterMapsReady) {
    TVX_LOG(TVX_DBG, "PERF: Waiting for m_AdapterMapsReadyMutex");
    m_AdapterMapsReadyCond.wait_until(m_AdapterMapsReadyMutex,
                                      [this] { return m_bIsAdapterMapsReady.load(); });
    TVX_LOG(TVX_DBG, "PERF: Woken up from wait for m_AdapterMapsReadyMutex");
  }
}

}  // namespace cimrt
