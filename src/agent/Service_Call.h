// How a method of a service begins.
#pragma once

#include "agent/ProviderAgent.h"

namespace cimrt {

/// The frame of a method or of a change of the model: asks for a refresh if one is due, waits for
/// the device tree and the adapter maps, and holds the agent's data lock until it goes. No agent
/// lock may be held when it is made.
class Service_Call {
 public:
  Service_Call();
  ProviderAgent& agent;

  /// Gives the data lock back early; nothing of the maps may be touched after that.
  void release() { m_Lock.release(); }

 private:
  Ranked_Lock m_Lock;
};

}  // namespace cimrt
