#include "http/OperationCall.h"

#include <fmt/format.h>

#include <algorithm>
#include <initializer_list>
#include <string_view>

#include "http/CimErrors.h"

namespace tvx::host::http {
namespace {

[[noreturn]] void invalid(const std::string& text) {
  throw CimError(CMPI_RC_ERR_INVALID_PARAMETER, text);
}

}  // namespace

/// One of the server's own operations with the parameters that it knows.
struct OperationCall::Row {
  const char* name;
  void (OperationCall::*run)();
  std::initializer_list<const char*> parameters;
};

const OperationCall::Row OperationCall::rows[] = {
    {"EnumerateInstances",
     &OperationCall::enumerateInstances,
     {"ClassName", "LocalOnly", "DeepInheritance", "IncludeQualifiers", "IncludeClassOrigin",
      "PropertyList"}},
    {"EnumerateInstanceNames", &OperationCall::enumerateInstanceNames, {"ClassName"}},
    {"GetInstance",
     &OperationCall::getInstance,
     {"InstanceName", "LocalOnly", "IncludeQualifiers", "IncludeClassOrigin", "PropertyList"}},
    {"CreateInstance", &OperationCall::createInstance, {"NewInstance"}},
    {"ModifyInstance",
     &OperationCall::modifyInstance,
     {"ModifiedInstance", "IncludeQualifiers", "PropertyList"}},
    {"DeleteInstance", &OperationCall::deleteInstance, {"InstanceName"}},
    {"Associators",
     &OperationCall::associators,
     {"ObjectName", "AssocClass", "ResultClass", "Role", "ResultRole", "IncludeQualifiers",
      "IncludeClassOrigin", "PropertyList"}},
    {"AssociatorNames",
     &OperationCall::associatorNames,
     {"ObjectName", "AssocClass", "ResultClass", "Role", "ResultRole"}},
    {"References",
     &OperationCall::references,
     {"ObjectName", "ResultClass", "Role", "IncludeQualifiers", "IncludeClassOrigin",
      "PropertyList"}},
    {"ReferenceNames", &OperationCall::referenceNames, {"ObjectName", "ResultClass", "Role"}},
    {"GetClass",
     &OperationCall::getClass,
     {"ClassName", "LocalOnly", "IncludeQualifiers", "IncludeClassOrigin", "PropertyList"}},
    {"EnumerateClasses",
     &OperationCall::enumerateClasses,
     {"ClassName", "DeepInheritance", "LocalOnly", "IncludeQualifiers", "IncludeClassOrigin"}},
    {"EnumerateClassNames", &OperationCall::enumerateClassNames, {"ClassName", "DeepInheritance"}},
    {"GetProperty", &OperationCall::getProperty, {"InstanceName", "PropertyName"}},
    {"SetProperty", &OperationCall::setProperty, {"InstanceName", "PropertyName", "NewValue"}}};

std::string OperationCall::run() {
  if (!m_Message.isIntrinsic()) {
    invokeMethod();
    return std::move(m_Out);
  }
  const auto row = std::find_if(std::begin(rows), std::end(rows), [&](const Row& each) {
    return sameName(each.name, m_Message.name());
  });
  if (row == std::end(rows)) {
    throw CimError(CMPI_RC_ERR_NOT_SUPPORTED,
                   fmt::format("operation {} is not supported", m_Message.name()));
  }
  checkParameters(*row);
  (this->*row->run)();
  return std::move(m_Out);
}

// ---- Parameters ----

void OperationCall::checkParameters(const Row& row) const {
  const auto& all = m_Message.parameters();
  for (auto each = all.begin(); each != all.end(); ++each) {
    const bool known = std::any_of(row.parameters.begin(), row.parameters.end(),
                                   [&](const char* name) { return sameName(name, each->name); });
    if (!known) {
      invalid(fmt::format("{} has no parameter '{}'", row.name, each->name));
    }
  }
  checkOnce();
}

void OperationCall::checkOnce() const {
  const auto& all = m_Message.parameters();
  for (auto each = all.begin(); each != all.end(); ++each) {
    const bool twice = std::any_of(all.begin(), each, [&](const CimMessage::Parameter& other) {
      return sameName(other.name, each->name);
    });
    if (twice) {
      invalid(fmt::format("parameter '{}' is there twice", each->name));
    }
  }
}

const CimMessage::Parameter* OperationCall::find(const char* name) const {
  const auto& all = m_Message.parameters();
  const auto found = std::find_if(all.begin(), all.end(), [&](const CimMessage::Parameter& each) {
    return sameName(each.name, name);
  });
  return found == all.end() ? nullptr : &*found;
}

pugi::xml_node OperationCall::element(const char* name) const {
  const CimMessage::Parameter* parameter = find(name);
  return parameter == nullptr ? pugi::xml_node() : firstElement(parameter->element);
}

ObjectPath OperationCall::requiredPath(const char* name) const {
  const pugi::xml_node found = element(name);
  if (!found) {
    invalid(fmt::format("{} needs {}", m_Message.name(), name));
  }
  return m_Reader.path(found);
}

std::string OperationCall::text(const char* name) const {
  return elementText(element(name));
}

std::string OperationCall::requiredText(const char* name) const {
  const std::string word = text(name);
  if (word.empty()) {
    invalid(fmt::format("{} needs {}", m_Message.name(), name));
  }
  return word;
}

bool OperationCall::flag(const char* name, bool otherwise) const {
  const std::string word = text(name);
  if (word.empty()) {
    return otherwise;
  }
  if (!sameName(word, "true") && !sameName(word, "false")) {
    invalid(fmt::format("{} is no boolean: '{}'", name, word));
  }
  return sameName(word, "true");
}

std::string OperationCall::classNameText(const char* name) const {
  const pugi::xml_node found = element(name);
  return found ? m_Reader.path(found).className : std::string();
}

std::optional<std::vector<std::string>> OperationCall::propertyList() const {
  const pugi::xml_node list = element("PropertyList");
  if (!list) {
    return std::nullopt;
  }
  std::vector<std::string> names;
  for (const pugi::xml_node& each : list.children("VALUE")) {
    names.push_back(elementText(each));
  }
  return names;
}

Selection OperationCall::selection() const {
  Selection result;
  result.properties = propertyList();
  result.withClassOrigin = flag("IncludeClassOrigin", false);
  return result;
}

Selection OperationCall::classSelection() const {
  Selection result = selection();
  result.localOnly = flag("LocalOnly", true);
  result.withQualifiers = flag("IncludeQualifiers", true);
  return result;
}

// ---- Requests ----

Request OperationCall::request(Operation operation, ObjectPath path) const {
  Request result;
  result.operation = operation;
  result.path = std::move(path);
  std::optional<std::vector<std::string>> names = propertyList();
  // Providers never see an empty list: it arrives as "all", and the answer is cut here.
  if (names && !names->empty()) {
    result.properties = std::move(names);
  }
  return result;
}

Request OperationCall::walk(Operation operation) const {
  const bool fromReferences =
      operation == Operation::References || operation == Operation::ReferenceNames;
  Request result = request(operation, requiredPath("ObjectName"));
  if (result.path.keys.empty()) {
    throw CimError(CMPI_RC_ERR_NOT_SUPPORTED, "associations of classes are not supported");
  }
  result.assocClass = fromReferences ? std::string() : classNameText("AssocClass");
  result.resultClass = classNameText("ResultClass");
  result.role = text("Role");
  result.resultRole = fromReferences ? std::string() : text("ResultRole");
  return result;
}

Reply OperationCall::send(const Request& request) {
  Reply reply = m_Broker.run(request);
  if (m_Accountant && reply.providersAsked > 0) {
    m_Accountant(reply.report);
  }
  if (!reply.status.ok()) {
    throw CimError(reply.status.rc, reply.status.message);
  }
  return reply;
}

void OperationCall::writeObjects(const Reply& reply) {
  const Selection wanted = selection();
  m_Out += "<IRETURNVALUE>";
  for (const Instance& each : reply.instances) {
    m_Out += "<VALUE.OBJECTWITHPATH>";
    m_Writer.instancePath(each.path, m_Message.nameSpace());
    m_Writer.instance(each, wanted);
    m_Out += "</VALUE.OBJECTWITHPATH>";
  }
  m_Out += "</IRETURNVALUE>";
}

void OperationCall::writePaths(const Reply& reply) {
  m_Out += "<IRETURNVALUE>";
  for (const ObjectPath& each : reply.paths) {
    m_Out += "<OBJECTPATH>";
    m_Writer.instancePath(each, m_Message.nameSpace());
    m_Out += "</OBJECTPATH>";
  }
  m_Out += "</IRETURNVALUE>";
}

// ---- Instances ----

void OperationCall::enumerateInstances() {
  const ObjectPath path = requiredPath("ClassName");
  Selection wanted = selection();
  if (!flag("DeepInheritance", true)) {
    wanted.asClass = m_Classes.find(path.className);
  }
  const Reply reply = send(request(Operation::EnumerateInstances, path));
  m_Out += "<IRETURNVALUE>";
  for (const Instance& each : reply.instances) {
    m_Out += "<VALUE.NAMEDINSTANCE>";
    m_Writer.instanceName(each.path);
    m_Writer.instance(each, wanted);
    m_Out += "</VALUE.NAMEDINSTANCE>";
  }
  m_Out += "</IRETURNVALUE>";
}

void OperationCall::enumerateInstanceNames() {
  const Reply reply = send(request(Operation::EnumerateInstanceNames, requiredPath("ClassName")));
  m_Out += "<IRETURNVALUE>";
  for (const ObjectPath& each : reply.paths) {
    m_Writer.instanceName(each);
  }
  m_Out += "</IRETURNVALUE>";
}

void OperationCall::getInstance() {
  const Reply reply = send(request(Operation::GetInstance, requiredPath("InstanceName")));
  if (reply.instances.empty()) {
    throw CimError(CMPI_RC_ERR_NOT_FOUND, "no such instance");
  }
  m_Out += "<IRETURNVALUE>";
  m_Writer.instance(reply.instances.front(), selection());
  m_Out += "</IRETURNVALUE>";
}

void OperationCall::createInstance() {
  Instance instance = m_Reader.instance(element("NewInstance"));
  for (const FeatureData& feature : features(requireClass(instance.className()))) {
    const Value* value = instance.properties.find(feature.name);
    if (feature.isKey && value != nullptr) {
      instance.path.keys.set(feature.name, *value);
    }
  }
  Request create = request(Operation::CreateInstance, instance.path);
  create.instance = std::move(instance);
  const Reply reply = send(create);
  m_Out += "<IRETURNVALUE>";
  m_Writer.instanceName(reply.paths.empty() ? create.path : reply.paths.front());
  m_Out += "</IRETURNVALUE>";
}

void OperationCall::modify(Instance instance, PropertyList properties) {
  instance.addKeysAsProperties();
  Request change = request(Operation::ModifyInstance, instance.path);
  change.properties = std::move(properties);
  change.instance = std::move(instance);
  send(change);
}

void OperationCall::modifyInstance() {
  const pugi::xml_node named = element("ModifiedInstance");
  if (!named.child("INSTANCENAME") || !named.child("INSTANCE")) {
    invalid("ModifyInstance needs ModifiedInstance with a name and an instance");
  }
  Instance instance = m_Reader.instance(named.child("INSTANCE"));
  instance.path = m_Reader.path(named.child("INSTANCENAME"));
  modify(std::move(instance), propertyList());
}

void OperationCall::deleteInstance() {
  send(request(Operation::DeleteInstance, requiredPath("InstanceName")));
}

void OperationCall::getProperty() {
  const ObjectPath path = requiredPath("InstanceName");
  const std::string name = requiredText("PropertyName");
  const FeatureData* feature = findFeature(requireClass(path.className), name);
  if (feature == nullptr) {
    throw CimError(CMPI_RC_ERR_NO_SUCH_PROPERTY,
                   fmt::format("class {} has no property '{}'", path.className, name));
  }
  Request get = request(Operation::GetInstance, path);
  get.properties = std::vector<std::string>{feature->name};
  const Reply reply = send(get);
  if (reply.instances.empty()) {
    throw CimError(CMPI_RC_ERR_NOT_FOUND, "no such instance");
  }
  const Value* value = reply.instances.front().properties.find(feature->name);
  m_Out += "<IRETURNVALUE>";
  if (value != nullptr) {
    m_Writer.value(*value);
  }
  m_Out += "</IRETURNVALUE>";
}

void OperationCall::setProperty() {
  Instance instance;
  instance.path = requiredPath("InstanceName");
  const std::string name = requiredText("PropertyName");
  const FeatureData* feature = findFeature(requireClass(instance.className()), name);
  if (feature == nullptr) {
    throw CimError(CMPI_RC_ERR_NO_SUCH_PROPERTY,
                   fmt::format("class {} has no property '{}'", instance.className(), name));
  }
  const CimMessage::Parameter* given = find("NewValue");
  const pugi::xml_node value = given == nullptr ? pugi::xml_node() : given->element;
  instance.properties.set(feature->name, m_Reader.value(*feature, value));
  modify(std::move(instance), std::vector<std::string>{feature->name});
}

// ---- Associations ----

void OperationCall::associators() {
  writeObjects(send(walk(Operation::Associators)));
}

void OperationCall::associatorNames() {
  writePaths(send(walk(Operation::AssociatorNames)));
}

void OperationCall::references() {
  writeObjects(send(walk(Operation::References)));
}

void OperationCall::referenceNames() {
  writePaths(send(walk(Operation::ReferenceNames)));
}

// ---- Classes ----

void OperationCall::requireNameSpace() const {
  if (!m_Classes.knowsNameSpace(m_Message.nameSpace())) {
    throw CimError(CMPI_RC_ERR_INVALID_NAMESPACE,
                   fmt::format("no namespace '{}' here", m_Message.nameSpace()));
  }
}

const ClassData& OperationCall::requireClass(const std::string& name) const {
  const ClassData* found = m_Classes.find(name);
  if (found == nullptr) {
    throw CimError(CMPI_RC_ERR_INVALID_CLASS, fmt::format("no class '{}'", name));
  }
  return *found;
}

void OperationCall::getClass() {
  requireNameSpace();
  const ClassData& classData = requireClass(requiredPath("ClassName").className);
  m_Out += "<IRETURNVALUE>";
  m_Writer.classElement(classData, classSelection());
  m_Out += "</IRETURNVALUE>";
}

std::vector<const ClassData*> OperationCall::wantedClasses() const {
  requireNameSpace();
  const std::string base = classNameText("ClassName");
  const ClassData* parent = base.empty() ? nullptr : &requireClass(base);
  const bool deep = flag("DeepInheritance", false);
  std::vector<const ClassData*> result;
  for (const ClassData* each : m_Classes.all()) {
    const bool child = parent == nullptr
                           ? each->superName == nullptr
                           : each->superName != nullptr && sameName(each->superName, parent->name);
    const bool below = parent == nullptr || (each != parent && m_Classes.isA(each->name, base));
    if (deep ? below : child) {
      result.push_back(each);
    }
  }
  return result;
}

void OperationCall::enumerateClasses() {
  const Selection wanted = classSelection();
  m_Out += "<IRETURNVALUE>";
  for (const ClassData* each : wantedClasses()) {
    m_Writer.classElement(*each, wanted);
  }
  m_Out += "</IRETURNVALUE>";
}

void OperationCall::enumerateClassNames() {
  m_Out += "<IRETURNVALUE>";
  for (const ClassData* each : wantedClasses()) {
    m_Writer.className(each->name);
  }
  m_Out += "</IRETURNVALUE>";
}

// ---- Methods ----

void OperationCall::invokeMethod() {
  const ObjectPath target = m_Reader.path(m_Message.target());
  const ClassData& classData = requireClass(target.className);
  const MethodData* method = findMethod(classData, m_Message.name());
  if (method == nullptr) {
    throw CimError(CMPI_RC_ERR_METHOD_NOT_FOUND,
                   fmt::format("class {} has no method '{}'", classData.name, m_Message.name()));
  }
  checkOnce();
  const ObjectReader reader(m_Classes, target.nameSpace);
  Request invoke = request(Operation::InvokeMethod, target);
  invoke.method = method->name;
  for (const CimMessage::Parameter& each : m_Message.parameters()) {
    const FeatureData* parameter = findParameter(*method, each.name);
    if (parameter == nullptr) {
      invalid(fmt::format("{}.{} has no parameter '{}'", classData.name, method->name, each.name));
    }
    // An output parameter may be listed by the client; it carries nothing in.
    if (parameter->isIn) {
      invoke.arguments.set(parameter->name, reader.value(*parameter, each.element));
    }
  }
  const Reply reply = send(invoke);
  m_Writer.returnValue(reply.returnValue);
  for (const NamedValue& each : reply.outputs) {
    m_Writer.parameterValue(each.name, each.value, findParameter(*method, each.name));
  }
}

}  // namespace tvx::host::http
