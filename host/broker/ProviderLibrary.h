// One provider library: opening, its factories, the interfaces that they made, closing.
#pragma once

#include <filesystem>
#include <map>
#include <mutex>
#include <string>
#include <utility>

#include "broker/Core.h"

namespace tvx::host {

/// All interfaces that the broker holds, of the library and of providers inside the program.
/// Factories and cleanups run one at a time, as a server's provider manager does it.
class ProviderLibrary {
 public:
  explicit ProviderLibrary(Core& core) : m_Core(core) {}
  ~ProviderLibrary();
  ProviderLibrary(const ProviderLibrary&) = delete;
  ProviderLibrary& operator=(const ProviderLibrary&) = delete;

  /// Throws LoadError.
  void open(const std::filesystem::path& library);
  bool isOpen() const { return m_Handle != nullptr; }
  void add(const std::string& className, const InProcessProvider& provider);
  /// True if the class was added rather than found in the library.
  bool isAdded(const std::string& className) const;
  std::vector<std::string> addedClasses() const;

  bool hasFactory(const std::string& className, InterfaceKind kind) const;
  /// Makes the interface on first need; null if there is no factory or it answered null.
  void* interface(const std::string& className, InterfaceKind kind);
  Status cleanup(const std::string& className, InterfaceKind kind, bool terminating);
  Status cleanupAll(bool terminating);
  /// One `cleanup` for all interfaces of a kind; the first refusal is answered.
  Status cleanupOncePerKind(bool terminating);
  void close();

 private:
  struct Known {
    std::string className;
    InterfaceKind kind;
    void* interface;
  };
  using Key = std::pair<std::string, InterfaceKind>;

  static Key keyOf(const std::string& className, InterfaceKind kind);
  void* factory(const std::string& className, InterfaceKind kind) const;
  void* make(const std::string& className, InterfaceKind kind);
  Status cleanupOne(const Known& known, bool terminating);

  Core& m_Core;
  void* m_Handle = nullptr;
  std::map<std::string, InProcessProvider> m_Added;  ///< by class name in lower case
  std::mutex m_Mutex;
  std::map<Key, Known> m_Known;  ///< guarded by m_Mutex
};

/// Entries of a context for a request into `nameSpace`.
NamedValues contextEntries(const BrokerOptions& options, const std::string& nameSpace);

/// Status of a CMPI call with its message copied.
Status statusOf(const CMPIStatus& status);

}  // namespace tvx::host
