#include "broker/Router.h"

#include <fmt/format.h>

#include <algorithm>

#include "broker/ProviderCall.h"

namespace tvx::host {
namespace {

bool isWalk(Operation operation) {
  return operation == Operation::Associators || operation == Operation::AssociatorNames ||
         operation == Operation::References || operation == Operation::ReferenceNames;
}

bool isEnumeration(Operation operation) {
  return operation == Operation::EnumerateInstanceNames ||
         operation == Operation::EnumerateInstances;
}

/// The association class that a walk is limited to, "" for none.
const std::string& walkClass(const Request& request) {
  return request.operation == Operation::Associators ||
                 request.operation == Operation::AssociatorNames
             ? request.assocClass
             : request.resultClass;
}

Reply failed(int rc, std::string message) {
  Reply reply;
  reply.status = {rc, std::move(message)};
  return reply;
}

template <class T>
void append(std::vector<T>& to, std::vector<T>& from) {
  std::move(from.begin(), from.end(), std::back_inserter(to));
}

/// Adds one provider's answer; the first failure stays.
void merge(Reply& total, Reply&& part) {
  append(total.instances, part.instances);
  append(total.paths, part.paths);
  append(total.data, part.data);
  if (total.status.ok()) {
    total.status = std::move(part.status);
  }
  total.done = total.done || part.done;
  total.providersAsked += part.providersAsked;
  total.report = std::move(part.report);
}

}  // namespace

Broker::Impl::Impl(BrokerOptions initial)
    : options(std::move(initial)), store(options), core(options, *this), library(core) {}

bool Broker::Impl::knowsClass(const std::string& className) const {
  return (options.classes != nullptr && options.classes->find(className) != nullptr) ||
         store.knowsClass(className) || library.isAdded(className) ||
         (options.classes == nullptr &&
          (library.hasFactory(className, InterfaceKind::Instance) ||
           library.hasFactory(className, InterfaceKind::Association) ||
           library.hasFactory(className, InterfaceKind::Method)));
}

Status Broker::Impl::checkPlace(const Request& request) const {
  const std::string& nameSpace = request.path.nameSpace;
  const auto& more = options.moreNameSpaces;
  const bool isMore = std::any_of(
      more.begin(), more.end(), [&](const std::string& each) { return sameName(each, nameSpace); });
  const bool knownPlace = isMore || nameSpace.empty() || options.classes == nullptr ||
                          options.classes->knowsNameSpace(nameSpace) ||
                          sameName(nameSpace, options.nameSpace) || store.knowsNameSpace(nameSpace);
  if (!knownPlace) {
    return {CMPI_RC_ERR_INVALID_NAMESPACE, fmt::format("no namespace '{}' here", nameSpace)};
  }
  if (!knowsClass(request.path.className)) {
    return {CMPI_RC_ERR_INVALID_CLASS, fmt::format("no class '{}'", request.path.className)};
  }
  return {};
}

std::vector<std::string> Broker::Impl::classesBelow(const std::string& base) const {
  std::vector<std::string> names;
  if (options.classes != nullptr) {
    for (const ClassData* each : options.classes->servedSubclasses(base)) {
      names.emplace_back(each->name);
    }
  }
  const auto add = [&](const std::string& name) {
    if (std::none_of(names.begin(), names.end(),
                     [&](const std::string& each) { return sameName(each, name); })) {
      names.push_back(name);
    }
  };
  for (const std::string& name : store.classesBelow(base)) {
    add(name);
  }
  if (names.empty() || library.isAdded(base)) {
    add(base);
  }
  return names;
}

std::vector<std::string> Broker::Impl::associationsBelow(const std::string& base) const {
  std::vector<std::string> names;
  if (options.classes != nullptr) {
    for (const ClassData* each : options.classes->servedAssociations(base)) {
      names.emplace_back(each->name);
    }
  }
  for (const std::string& name : library.addedClasses()) {
    const bool fits = base.empty() || sameName(base, name);
    const bool known = std::any_of(names.begin(), names.end(),
                                   [&](const std::string& each) { return sameName(each, name); });
    if (fits && !known && library.hasFactory(name, InterfaceKind::Association)) {
      names.push_back(name);
    }
  }
  for (const std::string& name : store.associationsBelow(base)) {
    if (!library.hasFactory(name, InterfaceKind::Association)) {
      names.push_back(name);
    }
  }
  if (names.empty() && !base.empty()) {
    names.push_back(base);
  }
  return names;
}

Reply Broker::Impl::foreignWalk(const Request& request) {
  Reply reply = store.answer(request);
  if (request.operation != Operation::Associators) {
    return reply;
  }
  Request get;
  get.operation = Operation::GetInstance;
  get.properties = request.properties;
  for (const ObjectPath& path : std::exchange(reply.paths, {})) {
    get.path = path;
    Reply one = upCall(get);
    append(reply.instances, one.instances);
  }
  return reply;
}

Reply Broker::Impl::run(const Request& request) {
  if (request.exact) {
    return call(isWalk(request.operation) ? walkClass(request) : request.path.className, request);
  }
  const Status place = checkPlace(request);
  if (!place.ok()) {
    return failed(place.rc, place.message);
  }
  return isWalk(request.operation) ? runWalk(request) : runInstances(request);
}

Reply Broker::Impl::runInstances(const Request& request) {
  if (!isEnumeration(request.operation)) {
    return one(request.path.className, request);
  }
  Reply total;
  for (const std::string& name : classesBelow(request.path.className)) {
    merge(total, one(name, request));
  }
  return total;
}

Reply Broker::Impl::runWalk(const Request& request) {
  const std::string& limit = walkClass(request);
  if (!limit.empty() && !knowsClass(limit)) {
    return failed(CMPI_RC_ERR_INVALID_CLASS, fmt::format("no class '{}'", limit));
  }
  Reply total;
  for (const std::string& name : associationsBelow(limit)) {
    Request each = request;
    (request.operation == Operation::Associators || request.operation == Operation::AssociatorNames
         ? each.assocClass
         : each.resultClass) = name;
    const bool foreign =
        !library.hasFactory(name, InterfaceKind::Association) && store.knowsClass(name);
    merge(total, foreign ? foreignWalk(each) : call(name, each));
  }
  return total;
}

Reply Broker::Impl::one(const std::string& className, const Request& request) {
  Request each = request;
  const ClassData* classData =
      options.classes == nullptr ? nullptr : options.classes->find(className);
  each.path.className = classData == nullptr ? className : classData->name;
  if (each.path.nameSpace.empty() && classData != nullptr && classData->nameSpace != nullptr) {
    each.path.nameSpace = classData->nameSpace;
  }
  const InterfaceKind kind = request.operation == Operation::InvokeMethod ? InterfaceKind::Method
                                                                          : InterfaceKind::Instance;
  if (!library.hasFactory(each.path.className, kind)) {
    if (store.knowsClass(className)) {
      return store.answer(each);
    }
    if (isEnumeration(request.operation)) {
      return Reply{};
    }
  }
  return call(each.path.className, each);
}

Reply Broker::Impl::call(const std::string& provider, const Request& request) {
  Request each = request;
  if (each.path.nameSpace.empty()) {
    each.path.nameSpace = options.nameSpace;
  }
  return ProviderCall(core, library, provider, each).run();
}

Reply Broker::Impl::upCall(const Request& request) {
  if (isWalk(request.operation)) {
    return run(request);
  }
  if (store.knowsClass(request.path.className)) {
    return store.answer(request);
  }
  const Status place = checkPlace(request);
  if (!place.ok()) {
    return failed(place.rc, place.message);
  }
  const InterfaceKind kind = request.operation == Operation::InvokeMethod ? InterfaceKind::Method
                                                                          : InterfaceKind::Instance;
  if (!library.hasFactory(request.path.className, kind) && isEnumeration(request.operation)) {
    return Reply{};
  }
  return one(request.path.className, request);
}

void Broker::Impl::indication(const std::string& nameSpace, Instance instance) {
  const std::lock_guard lock(m_Mutex);
  m_Indications.push_back({nameSpace, std::move(instance)});
}

std::vector<Indication> Broker::Impl::indications() const {
  const std::lock_guard lock(m_Mutex);
  return m_Indications;
}

}  // namespace tvx::host
