#include "broker/ForeignStore.h"

#include <fmt/format.h>

#include <algorithm>

#include "cim/JsonText.h"

namespace tvx::host {
namespace {

using Json = nlohmann::ordered_json;

constexpr int storeVersion = 1;
constexpr std::size_t none = static_cast<std::size_t>(-1);

bool contains(const std::vector<std::string>& names, const std::string& name) {
  return std::any_of(names.begin(), names.end(),
                     [&](const std::string& each) { return sameName(each, name); });
}

void addName(std::vector<std::string>& names, const std::string& name) {
  if (!contains(names, name)) {
    names.push_back(name);
  }
}

Instance filtered(const Instance& instance, const PropertyList& properties) {
  Instance result = instance;
  if (properties) {
    std::erase_if(result.properties.items(), [&](const NamedValue& property) {
      return !contains(*properties, property.name);
    });
  }
  return result;
}

std::ptrdiff_t referenceCount(const Instance& instance) {
  return std::count_if(instance.properties.begin(), instance.properties.end(),
                       [](const NamedValue& each) { return each.value.type() == CMPI_ref; });
}

/// The class that a walk goes over.
const std::string& linkClass(const Request& request) {
  const bool references =
      request.operation == Operation::References || request.operation == Operation::ReferenceNames;
  return references ? request.resultClass : request.assocClass;
}

bool fits(const std::string& filter, const std::string& name) {
  return filter.empty() || sameName(filter, name);
}

Status failure(int rc, std::string message) {
  return Status{rc, std::move(message)};
}

Json parsed(const std::string& text) {
  Json json = Json::parse(text);
  if (!json.is_object() || json.value("version", 0) != storeVersion) {
    throw std::runtime_error(fmt::format("the store needs \"version\": {}", storeVersion));
  }
  return json;
}

}  // namespace

void ForeignStore::add(const std::string& text) {
  const Json json = parsed(text);
  const JsonContext context{m_Options.classes, m_Options.nameSpace};
  std::vector<Instance> instances;
  std::vector<Method> newMethods;
  std::vector<Failure> failures;
  for (const Json& each : json.value("instances", Json::array())) {
    instances.push_back(instanceFromJson(each, context));
  }
  for (const Json& each : json.value("methods", Json::array())) {
    Method method{each.at("class"), each.at("method"), {}, {}};
    method.returnValue = untypedFromJson(each.value("return", Json()), context);
    const Json outputs = each.value("out", Json::object());
    for (const auto& [name, value] : outputs.items()) {
      method.outputs.set(name, untypedFromJson(value, context));
    }
    newMethods.push_back(std::move(method));
  }
  for (const Json& each : json.value("failures", Json::array())) {
    failures.push_back({each.at("class"),
                        each.at("operation"),
                        {each.value("rc", static_cast<int>(CMPI_RC_ERR_FAILED)),
                         each.value("message", std::string())}});
  }
  const auto nameSpaces = json.value("namespaces", std::vector<std::string>());

  const std::lock_guard lock(m_Mutex);
  for (Instance& instance : instances) {
    addName(m_Classes, instance.className());
    addName(m_NameSpaces, instance.path.nameSpace);
    m_Instances.push_back(std::move(instance));
  }
  for (Method& method : newMethods) {
    addName(m_Classes, method.className);
    m_Methods.push_back(std::move(method));
  }
  for (Failure& each : failures) {
    addName(m_Classes, each.className);
    m_Failures.push_back(std::move(each));
  }
  for (const std::string& nameSpace : nameSpaces) {
    addName(m_NameSpaces, nameSpace);
  }
}

bool ForeignStore::knowsClass(const std::string& className) const {
  const std::lock_guard lock(m_Mutex);
  return contains(m_Classes, className);
}

bool ForeignStore::knowsNameSpace(const std::string& nameSpace) const {
  const std::lock_guard lock(m_Mutex);
  return contains(m_NameSpaces, nameSpace);
}

bool ForeignStore::isBelow(const std::string& name, const std::string& base) const {
  return base.empty() || sameName(name, base) ||
         (m_Options.classes != nullptr && m_Options.classes->isA(name, base));
}

std::vector<std::string> ForeignStore::classesBelow(const std::string& base) const {
  const std::lock_guard lock(m_Mutex);
  std::vector<std::string> names;
  for (const std::string& name : m_Classes) {
    if (isBelow(name, base)) {
      names.push_back(name);
    }
  }
  return names;
}

std::vector<std::string> ForeignStore::associationsBelow(const std::string& base) const {
  const std::lock_guard lock(m_Mutex);
  std::vector<std::string> names;
  for (const Instance& instance : m_Instances) {
    if (isBelow(instance.className(), base) && referenceCount(instance) > 1) {
      addName(names, instance.className());
    }
  }
  return names;
}

std::vector<Instance> ForeignStore::instances(const std::string& className) const {
  const std::lock_guard lock(m_Mutex);
  std::vector<Instance> result;
  for (const Instance& instance : m_Instances) {
    if (sameName(instance.className(), className)) {
      result.push_back(instance);
    }
  }
  return result;
}

const ForeignStore::Failure* ForeignStore::failureOf(const Request& request) const {
  const auto found = std::find_if(m_Failures.begin(), m_Failures.end(), [&](const Failure& each) {
    return sameName(each.className, request.path.className) &&
           sameName(each.operation, operationName(request.operation));
  });
  return found == m_Failures.end() ? nullptr : &*found;
}

std::size_t ForeignStore::indexOf(const ObjectPath& path) const {
  const auto found =
      std::find_if(m_Instances.begin(), m_Instances.end(), [&](const Instance& each) {
        return each.path.sameObject(path) &&
               (path.nameSpace.empty() || sameName(each.path.nameSpace, path.nameSpace));
      });
  return found == m_Instances.end() ? none : static_cast<std::size_t>(found - m_Instances.begin());
}

Status ForeignStore::enumerate(const Request& request, Reply& reply) const {
  for (const Instance& instance : m_Instances) {
    if (!sameName(instance.className(), request.path.className) ||
        !(request.path.nameSpace.empty() ||
          sameName(instance.path.nameSpace, request.path.nameSpace))) {
      continue;
    }
    if (request.operation == Operation::EnumerateInstanceNames) {
      reply.paths.push_back(instance.path);
    } else {
      reply.instances.push_back(filtered(instance, request.properties));
    }
  }
  return {};
}

Status ForeignStore::get(const Request& request, Reply& reply) const {
  const std::size_t index = indexOf(request.path);
  if (index == none) {
    return failure(CMPI_RC_ERR_NOT_FOUND, "no such instance: " + printPath(request.path));
  }
  reply.instances.push_back(filtered(m_Instances[index], request.properties));
  return {};
}

Status ForeignStore::create(const Request& request, Reply& reply) {
  if (indexOf(request.path) != none) {
    return failure(CMPI_RC_ERR_ALREADY_EXISTS, "already there: " + printPath(request.path));
  }
  Instance instance = request.instance;
  instance.path = request.path;
  m_Instances.push_back(std::move(instance));
  reply.paths.push_back(request.path);
  return {};
}

Status ForeignStore::modify(const Request& request) {
  const std::size_t index = indexOf(request.path);
  if (index == none) {
    return failure(CMPI_RC_ERR_NOT_FOUND, "no such instance: " + printPath(request.path));
  }
  for (const NamedValue& property : request.instance.properties) {
    if (!request.properties || contains(*request.properties, property.name)) {
      m_Instances[index].properties.set(property.name, property.value);
    }
  }
  return {};
}

Status ForeignStore::remove(const Request& request) {
  const std::size_t index = indexOf(request.path);
  if (index == none) {
    return failure(CMPI_RC_ERR_NOT_FOUND, "no such instance: " + printPath(request.path));
  }
  m_Instances.erase(m_Instances.begin() + static_cast<std::ptrdiff_t>(index));
  return {};
}

Status ForeignStore::invoke(const Request& request, Reply& reply) const {
  for (const Method& method : m_Methods) {
    if (sameName(method.className, request.path.className) &&
        sameName(method.name, request.method)) {
      reply.returnValue = method.returnValue;
      reply.outputs = method.outputs;
      return {};
    }
  }
  return failure(CMPI_RC_ERR_METHOD_NOT_FOUND,
                 fmt::format("{} has no method {}", request.path.className, request.method));
}

/// False if `link` does not refer to the source of the walk, in its role.
bool ForeignStore::farEnds(const Instance& link, const Request& request,
                           std::vector<ObjectPath>& ends) const {
  bool matched = false;
  const bool references = &linkClass(request) == &request.resultClass;
  for (const NamedValue& property : link.properties) {
    if (property.value.type() != CMPI_ref || property.value.isNull()) {
      continue;
    }
    const ObjectPath& target = property.value.asReference();
    if (target.sameObject(request.path)) {
      matched = matched || fits(request.role, property.name);
    } else if (!references && isBelow(target.className, request.resultClass) &&
               fits(request.resultRole, property.name)) {
      ends.push_back(target);
    }
  }
  return matched;
}

Status ForeignStore::walk(const Request& request, Reply& reply) const {
  for (const Instance& link : m_Instances) {
    std::vector<ObjectPath> ends;
    if (!sameName(link.className(), linkClass(request)) || !farEnds(link, request, ends)) {
      continue;
    }
    if (request.operation == Operation::References) {
      reply.instances.push_back(filtered(link, request.properties));
    } else if (request.operation == Operation::ReferenceNames) {
      reply.paths.push_back(link.path);
    } else {
      std::move(ends.begin(), ends.end(), std::back_inserter(reply.paths));
    }
  }
  return {};
}

Reply ForeignStore::answer(const Request& request) {
  Reply reply;
  reply.providersAsked = 1;
  const std::lock_guard lock(m_Mutex);
  if (const Failure* planned = failureOf(request)) {
    reply.status = planned->status;
    return reply;
  }
  switch (request.operation) {
    case Operation::EnumerateInstanceNames:
    case Operation::EnumerateInstances:
      reply.status = enumerate(request, reply);
      break;
    case Operation::GetInstance:
      reply.status = get(request, reply);
      break;
    case Operation::CreateInstance:
      reply.status = create(request, reply);
      break;
    case Operation::ModifyInstance:
      reply.status = modify(request);
      break;
    case Operation::DeleteInstance:
      reply.status = remove(request);
      break;
    case Operation::InvokeMethod:
      reply.status = invoke(request, reply);
      break;
    case Operation::ExecQuery:
      reply.status = failure(CMPI_RC_ERR_NOT_SUPPORTED, "queries are not supported");
      break;
    default:
      reply.status = walk(request, reply);
      break;
  }
  reply.done = reply.status.ok();
  return reply;
}

}  // namespace tvx::host
