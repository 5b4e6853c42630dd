#include "agent/Service_Call.h"

namespace cimrt {

namespace {

/// The agent, once it has something to say.
ProviderAgent& readyAgent() {
  ProviderAgent& agent = *ProviderAgent::getInstance();
  agent.awaitAdapterMaps();
  return agent;
}

}  // namespace

Service_Call::Service_Call() : agent(readyAgent()), m_Lock(agent.m_DataMutex) {}

}  // namespace cimrt
