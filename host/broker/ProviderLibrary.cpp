#include "broker/ProviderLibrary.h"

#include <dlfcn.h>
#include <fmt/format.h>

#include <algorithm>

#include "broker/Objects.h"

namespace tvx::host {
namespace {

constexpr const char* interfaceNames[] = {"Instance", "Association", "Method"};

const char* nameOf(InterfaceKind kind) {
  return interfaceNames[static_cast<std::size_t>(kind)];
}

using Factory = void* (*)(const CMPIBroker*, const CMPIContext*, CMPIStatus*);

template <class MI>
CMPIStatus callCleanup(void* interface, const CMPIContext* context, bool terminating) {
  auto* mi = static_cast<MI*>(interface);
  return mi->ft->cleanup(mi, context, terminating ? 1 : 0);
}

}  // namespace

NamedValues contextEntries(const BrokerOptions& options, const std::string& nameSpace) {
  NamedValues entries;
  if (options.version != 0) {
    entries.set(CMPIInitNameSpace, Value::string(nameSpace));
  }
  entries.set(CMPIInvocationFlags, Value::number(CMPI_uint32, 0));
  entries.set(CMPIPrincipal,
              options.user ? Value::string(*options.user) : Value::stringWithoutText());
  return entries;
}

Status statusOf(const CMPIStatus& status) {
  Status result{status.rc, {}};
  const StringObject* message = StringObject::from(status.msg, "the message of a status");
  if (message != nullptr) {
    result.message = message->contents.text.value_or("");
  }
  return result;
}

ProviderLibrary::~ProviderLibrary() {
  cleanupAll(true);
  close();
}

void ProviderLibrary::open(const std::filesystem::path& library) {
  if (m_Handle != nullptr) {
    throw LoadError("a provider library is open already");
  }
  m_Handle = dlopen(library.c_str(), RTLD_NOW | RTLD_LOCAL);
  if (m_Handle == nullptr) {
    const char* reason = dlerror();
    throw LoadError(fmt::format("cannot load the provider library '{}': {}", library.string(),
                                reason == nullptr ? "unknown reason" : reason));
  }
}

ProviderLibrary::Key ProviderLibrary::keyOf(const std::string& className, InterfaceKind kind) {
  std::string lowered = className;
  std::transform(lowered.begin(), lowered.end(), lowered.begin(), [](char c) {
    return (c >= 'A' && c <= 'Z') ? static_cast<char>(c - 'A' + 'a') : c;
  });
  return {lowered, kind};
}

void ProviderLibrary::add(const std::string& className, const InProcessProvider& provider) {
  m_Added[keyOf(className, InterfaceKind::Instance).first] = provider;
}

bool ProviderLibrary::isAdded(const std::string& className) const {
  return m_Added.contains(keyOf(className, InterfaceKind::Instance).first);
}

std::vector<std::string> ProviderLibrary::addedClasses() const {
  std::vector<std::string> names;
  for (const auto& [name, provider] : m_Added) {
    names.push_back(name);
  }
  return names;
}

void* ProviderLibrary::factory(const std::string& className, InterfaceKind kind) const {
  const auto added = m_Added.find(keyOf(className, kind).first);
  if (added != m_Added.end()) {
    switch (kind) {
      case InterfaceKind::Instance:
        return reinterpret_cast<void*>(added->second.instance);
      case InterfaceKind::Association:
        return reinterpret_cast<void*>(added->second.association);
      case InterfaceKind::Method:
        return reinterpret_cast<void*>(added->second.method);
    }
  }
  if (m_Handle == nullptr) {
    return nullptr;
  }
  for (const char* form : {"{}_Provider_Create_{}MI", "{}_Create_{}MI"}) {
    const std::string name = fmt::format(fmt::runtime(form), className, nameOf(kind));
    if (void* symbol = dlsym(m_Handle, name.c_str())) {
      return symbol;
    }
  }
  return nullptr;
}

bool ProviderLibrary::hasFactory(const std::string& className, InterfaceKind kind) const {
  return factory(className, kind) != nullptr;
}

void* ProviderLibrary::make(const std::string& className, InterfaceKind kind) {
  auto* create = reinterpret_cast<Factory>(factory(className, kind));
  if (create == nullptr) {
    return nullptr;
  }
  Scope scope(m_Core, fmt::format("factory of {} for {}", nameOf(kind), className));
  const ScopeGuard guard(scope);
  CMPIContext* context = makeContext(
      m_Core, contextEntries(m_Core.options(), m_Core.options().nameSpace), Origin::HandedOut);
  CMPIStatus rc{CMPI_RC_OK, nullptr};
  void* interface = create(m_Core.face(), context, &rc);
  return rc.rc == CMPI_RC_OK ? interface : nullptr;
}

void* ProviderLibrary::interface(const std::string& className, InterfaceKind kind) {
  const Key key = keyOf(className, kind);
  const std::lock_guard lock(m_Mutex);
  const auto found = m_Known.find(key);
  if (found != m_Known.end()) {
    return found->second.interface;
  }
  void* made = make(className, kind);
  if (made != nullptr) {
    m_Known.emplace(key, Known{className, kind, made});
  }
  return made;
}

Status ProviderLibrary::cleanupOne(const Known& known, bool terminating) {
  Scope scope(m_Core, fmt::format("cleanup of {} for {}", nameOf(known.kind), known.className));
  const ScopeGuard guard(scope);
  CMPIContext* context = makeContext(
      m_Core, contextEntries(m_Core.options(), m_Core.options().nameSpace), Origin::HandedOut);
  switch (known.kind) {
    case InterfaceKind::Instance:
      return statusOf(callCleanup<CMPIInstanceMI>(known.interface, context, terminating));
    case InterfaceKind::Association:
      return statusOf(callCleanup<CMPIAssociationMI>(known.interface, context, terminating));
    default:
      return statusOf(callCleanup<CMPIMethodMI>(known.interface, context, terminating));
  }
}

Status ProviderLibrary::cleanup(const std::string& className, InterfaceKind kind,
                                bool terminating) {
  const std::lock_guard lock(m_Mutex);
  const auto found = m_Known.find(keyOf(className, kind));
  if (found == m_Known.end()) {
    return {CMPI_RC_ERR_NOT_FOUND, className + " has no such interface in use"};
  }
  Status result = cleanupOne(found->second, terminating);
  if (result.ok()) {
    m_Known.erase(found);
  }
  return result;
}

Status ProviderLibrary::cleanupAll(bool terminating) {
  const std::lock_guard lock(m_Mutex);
  Status first;
  std::erase_if(m_Known, [&](const auto& entry) {
    Status result = cleanupOne(entry.second, terminating);
    if (first.ok()) {
      first = result;
    }
    return result.ok();
  });
  return first;
}

Status ProviderLibrary::cleanupOncePerKind(bool terminating) {
  const std::lock_guard lock(m_Mutex);
  Status first;
  for (const InterfaceKind kind :
       {InterfaceKind::Instance, InterfaceKind::Association, InterfaceKind::Method}) {
    const auto one = std::find_if(m_Known.begin(), m_Known.end(),
                                  [&](const auto& entry) { return entry.second.kind == kind; });
    if (one == m_Known.end()) {
      continue;
    }
    Status result = cleanupOne(one->second, terminating);
    if (first.ok()) {
      first = std::move(result);
    }
  }
  m_Known.clear();
  return first;
}

void ProviderLibrary::close() {
  if (m_Handle != nullptr) {
    dlclose(m_Handle);
    m_Handle = nullptr;
  }
}

}  // namespace tvx::host
