#include "Broker.h"

#include <dlfcn.h>

#include <fstream>
#include <sstream>
#include <utility>

#include "broker/Router.h"

namespace tvx::host {
namespace {

constexpr const char* operationNames[] = {
    "enumerateInstanceNames", "enumerateInstances", "getInstance",    "createInstance",
    "modifyInstance",         "deleteInstance",     "execQuery",      "associators",
    "associatorNames",        "references",         "referenceNames", "invokeMethod"};

Request requestFor(Operation operation, ObjectPath path) {
  Request request;
  request.operation = operation;
  request.path = std::move(path);
  return request;
}

Request requestForClass(Operation operation, std::string_view className) {
  ObjectPath path;
  path.className = className;
  return requestFor(operation, std::move(path));
}

}  // namespace

const char* operationName(Operation operation) {
  return operationNames[static_cast<std::size_t>(operation)];
}

Broker::Broker(BrokerOptions options) : m_Impl(std::make_unique<Impl>(std::move(options))) {}

Broker::~Broker() = default;

void Broker::load(const std::filesystem::path& library) {
  m_Impl->library.open(library);
}

bool Broker::isLoaded() const {
  return m_Impl->library.isOpen();
}

void Broker::addProvider(const std::string& className, const InProcessProvider& provider) {
  m_Impl->library.add(className, provider);
}

bool Broker::hasInterface(const std::string& className, InterfaceKind kind) {
  return m_Impl->library.hasFactory(className, kind);
}

void* Broker::interface(const std::string& className, InterfaceKind kind) {
  return m_Impl->library.interface(className, kind);
}

Status Broker::cleanup(const std::string& className, InterfaceKind kind, bool terminating) {
  return m_Impl->library.cleanup(className, kind, terminating);
}

Status Broker::cleanupOncePerKind(bool terminating) {
  return m_Impl->library.cleanupOncePerKind(terminating);
}

Status Broker::unload(bool terminating) {
  Status result = m_Impl->library.cleanupAll(terminating);
  if (result.ok()) {
    m_Impl->library.close();
  }
  return result;
}

bool Broker::stillMapped(const std::filesystem::path& library) const {
  void* handle = dlopen(library.c_str(), RTLD_NOW | RTLD_NOLOAD);
  if (handle != nullptr) {
    dlclose(handle);
  }
  return handle != nullptr;
}

const CMPIBroker* Broker::face() const {
  return m_Impl->core.face();
}

Reply Broker::run(const Request& request) {
  Reply reply = m_Impl->run(request);
  if (request.takeInstance) {
    for (const Instance& kept : std::exchange(reply.instances, {})) request.takeInstance(kept);
  }
  return reply;
}

Reply Broker::enumerateInstanceNames(std::string_view className) {
  return run(requestForClass(Operation::EnumerateInstanceNames, className));
}

Reply Broker::enumerateInstances(std::string_view className, const PropertyList& properties) {
  Request request = requestForClass(Operation::EnumerateInstances, className);
  request.properties = properties;
  return run(request);
}

Reply Broker::getInstance(const ObjectPath& path, const PropertyList& properties) {
  Request request = requestFor(Operation::GetInstance, path);
  request.properties = properties;
  return run(request);
}

Reply Broker::createInstance(const Instance& instance) {
  Request request = requestFor(Operation::CreateInstance, instance.path);
  request.instance = instance;
  return run(request);
}

Reply Broker::modifyInstance(const Instance& instance, const PropertyList& properties) {
  Request request = requestFor(Operation::ModifyInstance, instance.path);
  request.instance = instance;
  request.properties = properties;
  return run(request);
}

Reply Broker::deleteInstance(const ObjectPath& path) {
  return run(requestFor(Operation::DeleteInstance, path));
}

Reply Broker::execQuery(std::string_view className, const std::string& query,
                        const std::string& language) {
  Request request = requestForClass(Operation::ExecQuery, className);
  request.query = query;
  request.language = language;
  return run(request);
}

Reply Broker::associators(const ObjectPath& source, const std::string& assocClass,
                          const std::string& resultClass, const std::string& role,
                          const std::string& resultRole, const PropertyList& properties) {
  Request request = requestFor(Operation::Associators, source);
  request.assocClass = assocClass;
  request.resultClass = resultClass;
  request.role = role;
  request.resultRole = resultRole;
  request.properties = properties;
  return run(request);
}

Reply Broker::associatorNames(const ObjectPath& source, const std::string& assocClass,
                              const std::string& resultClass, const std::string& role,
                              const std::string& resultRole) {
  Request request = requestFor(Operation::AssociatorNames, source);
  request.assocClass = assocClass;
  request.resultClass = resultClass;
  request.role = role;
  request.resultRole = resultRole;
  return run(request);
}

Reply Broker::references(const ObjectPath& source, const std::string& resultClass,
                         const std::string& role, const PropertyList& properties) {
  Request request = requestFor(Operation::References, source);
  request.resultClass = resultClass;
  request.role = role;
  request.properties = properties;
  return run(request);
}

Reply Broker::referenceNames(const ObjectPath& source, const std::string& resultClass,
                             const std::string& role) {
  Request request = requestFor(Operation::ReferenceNames, source);
  request.resultClass = resultClass;
  request.role = role;
  return run(request);
}

Reply Broker::invokeMethod(const ObjectPath& path, const std::string& method,
                           const NamedValues& arguments) {
  Request request = requestFor(Operation::InvokeMethod, path);
  request.method = method;
  request.arguments = arguments;
  return run(request);
}

ObjectPath Broker::path(std::string_view text) const {
  return parsePath(text, m_Impl->options.nameSpace, m_Impl->options.classes);
}

void Broker::addForeign(const std::string& json) {
  m_Impl->store.add(json);
}

void Broker::addForeignFile(const std::filesystem::path& file) {
  std::ifstream stream(file);
  if (!stream) {
    throw std::runtime_error("cannot read '" + file.string() + "'");
  }
  std::ostringstream text;
  text << stream.rdbuf();
  try {
    addForeign(text.str());
  } catch (const std::exception& error) {
    throw std::runtime_error("'" + file.string() + "': " + error.what());
  }
}

std::vector<Instance> Broker::foreignInstances(const std::string& className) const {
  return m_Impl->store.instances(className);
}

std::vector<Indication> Broker::indications() const {
  return m_Impl->indications();
}

std::vector<std::string> Broker::logLines() const {
  return m_Impl->core.logLines();
}

ScopeReport Broker::permanentReport() {
  return m_Impl->core.permanent().report();
}

std::vector<ScopeReport> Broker::threadReports() const {
  return m_Impl->core.threadReports();
}

std::size_t Broker::openAttachments() const {
  return m_Impl->core.openAttachments();
}

std::vector<std::string> Broker::lateNotes() const {
  return m_Impl->core.lateNotes();
}

}  // namespace tvx::host
