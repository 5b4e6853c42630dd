// Sends each request to the providers that have to answer it.
#pragma once

#include <mutex>

#include "broker/ForeignStore.h"
#include "broker/ProviderLibrary.h"

namespace tvx::host {

class Broker::Impl : public UpCallTarget {
 public:
  explicit Impl(BrokerOptions initial);

  /// A client's request: reaches subclasses and, for associations, every class that fits.
  Reply run(const Request& request);
  /// A provider's request: the store first, else the provider of that very class. It never
  /// searches subclasses, so that a provider that waits for this answer cannot meet itself.
  Reply upCall(const Request& request) override;
  void indication(const std::string& nameSpace, Instance instance) override;
  std::vector<Indication> indications() const;

  const BrokerOptions options;
  ForeignStore store;
  Core core;
  ProviderLibrary library;  ///< last, so that it is unloaded first

 private:
  Status checkPlace(const Request& request) const;
  bool knowsClass(const std::string& className) const;
  Reply runInstances(const Request& request);
  Reply runWalk(const Request& request);
  /// A walk over one class of foreign associations, whose far ends may be anybody's.
  Reply foreignWalk(const Request& request);
  std::vector<std::string> classesBelow(const std::string& base) const;
  std::vector<std::string> associationsBelow(const std::string& base) const;
  Reply one(const std::string& className, const Request& request);
  Reply call(const std::string& provider, const Request& request);

  mutable std::mutex m_Mutex;
  std::vector<Indication> m_Indications;  ///< guarded by m_Mutex
};

}  // namespace tvx::host
