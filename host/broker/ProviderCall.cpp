#include "broker/ProviderCall.h"

#include <fmt/format.h>

#include "broker/Objects.h"

namespace tvx::host {
namespace {

InterfaceKind kindOf(Operation operation) {
  switch (operation) {
    case Operation::Associators:
    case Operation::AssociatorNames:
    case Operation::References:
    case Operation::ReferenceNames:
      return InterfaceKind::Association;
    case Operation::InvokeMethod:
      return InterfaceKind::Method;
    default:
      return InterfaceKind::Instance;
  }
}

/// The empty text stands for an absent filter.
const char* filterText(const std::string& text) {
  return text.empty() ? nullptr : text.c_str();
}

KeyForm keyForm(const BrokerOptions& options) {
  if (options.keys != KeyForm::OfVersion) {
    return options.keys;
  }
  return options.version == 0 ? KeyForm::Unsigned64 : KeyForm::Signed64;
}

bool isInteger(CMPIType type) {
  return type >= CMPI_uint8 && type <= CMPI_sint64;
}

Value integerKey(const Value& value, KeyForm form) {
  const bool isSigned = value.type() >= CMPI_SINT;
  if (form == KeyForm::Unsigned64 && !(isSigned && value.asSigned() < 0)) {
    return Value::number(CMPI_uint64, value.asUnsigned());
  }
  const std::int64_t wide =
      isSigned ? value.asSigned() : static_cast<std::int64_t>(value.asUnsigned());
  return Value::signedNumber(CMPI_sint64, wide);
}

Value serversKey(const Value& value, const BrokerOptions& options) {
  const KeyForm form = keyForm(options);
  if (value.isNull()) {
    return value;
  }
  if (value.type() == CMPI_ref) {
    return Value::reference(withServersKeys(value.asReference(), options));
  }
  const bool asText = isInteger(value.type()) || value.type() == CMPI_boolean;
  if (form == KeyForm::Text && asText) {
    return Value::string(value.display());
  }
  return isInteger(value.type()) && form != KeyForm::Declared ? integerKey(value, form) : value;
}

}  // namespace

ObjectPath withServersKeys(const ObjectPath& path, const BrokerOptions& options) {
  ObjectPath result = path;
  for (NamedValue& key : result.keys.items()) {
    key.value = serversKey(key.value, options);
  }
  return result;
}

ProviderCall::ProviderCall(Core& core, ProviderLibrary& library, const std::string& provider,
                           const Request& request)
    : m_Core(core), m_Library(library), m_Provider(provider), m_Request(request) {}

void ProviderCall::makeObjects() {
  m_Context = makeContext(m_Core, contextEntries(m_Core.options(), m_Request.path.nameSpace),
                          Origin::HandedOut);
  m_Result = makeResult(m_Core, m_Reply, &m_Request);
  ObjectPath path = withServersKeys(m_Request.path, m_Core.options());
  if (!m_Core.options().tellsNameSpace) {
    path.nameSpace.clear();
  }
  m_Path = makePath(m_Core, std::move(path), Origin::HandedOut);
  if (m_Request.properties) {
    for (const std::string& name : *m_Request.properties) {
      m_Names.push_back(name.c_str());
    }
    m_Names.push_back(nullptr);
    m_Properties = m_Names.data();
  }
}

Reply ProviderCall::run() {
  const InterfaceKind kind = kindOf(m_Request.operation);
  void* interface = m_Library.interface(m_Provider, kind);
  if (interface == nullptr) {
    m_Reply.status = {CMPI_RC_ERR_NOT_SUPPORTED,
                      fmt::format("class '{}' has no provider for {}", m_Provider,
                                  operationName(m_Request.operation))};
    return std::move(m_Reply);
  }
  Scope scope(m_Core, fmt::format("{} {}", operationName(m_Request.operation), m_Provider));
  {
    const ScopeGuard guard(scope);
    makeObjects();
    m_Reply.status = statusOf(dispatch(interface));
  }
  m_Reply.report = scope.end();
  m_Reply.providersAsked = 1;
  return std::move(m_Reply);
}

CMPIStatus ProviderCall::dispatch(void* interface) {
  switch (kindOf(m_Request.operation)) {
    case InterfaceKind::Association:
      return callAssociation(static_cast<CMPIAssociationMI*>(interface));
    case InterfaceKind::Method:
      return callMethod(static_cast<CMPIMethodMI*>(interface));
    default:
      return callInstance(static_cast<CMPIInstanceMI*>(interface));
  }
}

CMPIStatus ProviderCall::callInstance(CMPIInstanceMI* mi) {
  const CMPIInstanceMIFT& table = *mi->ft;
  switch (m_Request.operation) {
    case Operation::EnumerateInstanceNames:
      return table.enumerateInstanceNames(mi, m_Context, m_Result, m_Path);
    case Operation::EnumerateInstances:
      return table.enumerateInstances(mi, m_Context, m_Result, m_Path, m_Properties);
    case Operation::GetInstance:
      return table.getInstance(mi, m_Context, m_Result, m_Path, m_Properties);
    case Operation::DeleteInstance:
      return table.deleteInstance(mi, m_Context, m_Result, m_Path);
    case Operation::ExecQuery:
      return table.execQuery(mi, m_Context, m_Result, m_Path, m_Request.query.c_str(),
                             m_Request.language.c_str());
    default:
      break;
  }
  Instance instance = m_Request.instance;
  instance.path = m_Request.path;
  const CMPIInstance* object = makeInstance(m_Core, std::move(instance), Origin::HandedOut);
  return m_Request.operation == Operation::CreateInstance
             ? table.createInstance(mi, m_Context, m_Result, m_Path, object)
             : table.modifyInstance(mi, m_Context, m_Result, m_Path, object, m_Properties);
}

CMPIStatus ProviderCall::callAssociation(CMPIAssociationMI* mi) {
  const CMPIAssociationMIFT& table = *mi->ft;
  const char* assocClass = filterText(m_Request.assocClass);
  const char* resultClass = filterText(m_Request.resultClass);
  const char* role = filterText(m_Request.role);
  const char* resultRole = filterText(m_Request.resultRole);
  switch (m_Request.operation) {
    case Operation::Associators:
      return table.associators(mi, m_Context, m_Result, m_Path, assocClass, resultClass, role,
                               resultRole, m_Properties);
    case Operation::AssociatorNames:
      return table.associatorNames(mi, m_Context, m_Result, m_Path, assocClass, resultClass, role,
                                   resultRole);
    case Operation::References:
      return table.references(mi, m_Context, m_Result, m_Path, resultClass, role, m_Properties);
    default:
      return table.referenceNames(mi, m_Context, m_Result, m_Path, resultClass, role);
  }
}

CMPIStatus ProviderCall::callMethod(CMPIMethodMI* mi) {
  CMPIArgs* in = makeArgs(m_Core, m_Request.arguments, Origin::HandedOut);
  CMPIArgs* out = makeArgs(m_Core, {}, Origin::HandedOut);
  const CMPIStatus result =
      mi->ft->invokeMethod(mi, m_Context, m_Result, m_Path, m_Request.method.c_str(), in, out);
  m_Reply.outputs = ArgsObject::from(out, "the output arguments")->contents;
  if (!m_Reply.data.empty()) {
    m_Reply.returnValue = m_Reply.data.front();
    m_Reply.data.erase(m_Reply.data.begin());
  }
  return result;
}

}  // namespace tvx::host
