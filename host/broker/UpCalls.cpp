// The broker's table of up-calls: requests that a provider makes of the server.
#include "broker/Marshal.h"

namespace tvx::host {
namespace {

PropertyList listOf(const char** names) {
  if (names == nullptr) {
    return std::nullopt;
  }
  std::vector<std::string> list;
  for (; *names != nullptr; ++names) {
    list.emplace_back(*names);
  }
  return list;
}

std::string textOf(const char* text) {
  return text == nullptr ? std::string() : text;
}

/// One up-call: reads the path, runs the request, keeps the answer.
class UpCall {
 public:
  UpCall(const CMPIBroker* broker, const CMPIContext* context, const CMPIObjectPath* path,
         Operation operation)
      : m_Core(Core::of(broker)) {
    m_Request.operation = operation;
    const PathObject* object = PathObject::from(path, operationName(operation));
    const ContextObject* known = ContextObject::from(context, operationName(operation));
    if (object == nullptr || known == nullptr) {
      m_Rc = CMPI_RC_ERR_INVALID_HANDLE;
      return;
    }
    m_Request.path = object->contents;
    if (currentScope(m_Core) == nullptr && m_Core.options().attaches) {
      m_Core.noteLate(std::string(operationName(operation)) +
                      " was called on a thread that is not attached");
      m_Rc = m_Core.options().version == 0 ? CMPI_RC_OK : CMPI_RC_ERR_FAILED;
    }
  }

  Request& request() { return m_Request; }

  /// The request's code; runs it if nothing failed before.
  CMPIrc run() {
    if (m_Rc == CMPI_RC_OK) {
      m_Reply = m_Core.target().upCall(m_Request);
      m_Rc = static_cast<CMPIrc>(m_Reply.status.rc);
    }
    return m_Rc;
  }
  CMPIrc run(CMPIStatus* rc) {
    setStatus(rc, run());
    if (rc != nullptr && m_Rc != CMPI_RC_OK && !m_Reply.status.message.empty()) {
      rc->msg = makeString(m_Core, m_Reply.status.message, Origin::HandedOut);
    }
    return m_Rc;
  }

  CMPIEnumeration* instances(CMPIStatus* rc) {
    return run(rc) == CMPI_RC_OK ? enumerationOf(m_Reply.instances, CMPI_instance) : nullptr;
  }
  CMPIEnumeration* paths(CMPIStatus* rc) {
    return run(rc) == CMPI_RC_OK ? enumerationOf(m_Reply.paths, CMPI_ref) : nullptr;
  }

  Core& core() { return m_Core; }
  Reply& reply() { return m_Reply; }

 private:
  static Value wrap(Instance& instance) { return Value::embedded(std::move(instance)); }
  static Value wrap(ObjectPath& path) { return Value::reference(std::move(path)); }

  template <class T>
  CMPIEnumeration* enumerationOf(std::vector<T>& items, CMPIType type) {
    Value::List values;
    values.reserve(items.size());
    for (T& item : items) {
      values.push_back(wrap(item));
    }
    return makeEnumeration(m_Core, type, std::move(values), Origin::HandedOut);
  }

  Core& m_Core;
  Request m_Request;
  Reply m_Reply;
  CMPIrc m_Rc = CMPI_RC_OK;
};

// ---- Threads and indications ----

CMPIContext* prepareAttachThread(const CMPIBroker* broker, const CMPIContext* context) {
  return Core::of(broker).prepareAttach(context);
}
CMPIStatus attachThread(const CMPIBroker* broker, const CMPIContext* context) {
  return Core::of(broker).attach(context);
}
CMPIStatus detachThread(const CMPIBroker* broker, const CMPIContext* context) {
  return Core::of(broker).detach(context);
}

CMPIStatus deliverIndication(const CMPIBroker* broker, const CMPIContext*, const char* nameSpace,
                             const CMPIInstance* instance) {
  const InstanceObject* object = InstanceObject::from(instance, "deliverIndication");
  if (object == nullptr) {
    return status(CMPI_RC_ERR_INVALID_HANDLE);
  }
  Core::of(broker).target().indication(textOf(nameSpace), object->contents.instance);
  return status(CMPI_RC_OK);
}

// ---- Instances ----

CMPIEnumeration* enumerateInstanceNames(const CMPIBroker* broker, const CMPIContext* context,
                                        const CMPIObjectPath* path, CMPIStatus* rc) {
  return UpCall(broker, context, path, Operation::EnumerateInstanceNames).paths(rc);
}

CMPIEnumeration* enumerateInstances(const CMPIBroker* broker, const CMPIContext* context,
                                    const CMPIObjectPath* path, const char** properties,
                                    CMPIStatus* rc) {
  UpCall call(broker, context, path, Operation::EnumerateInstances);
  call.request().properties = listOf(properties);
  return call.instances(rc);
}

CMPIInstance* getInstance(const CMPIBroker* broker, const CMPIContext* context,
                          const CMPIObjectPath* path, const char** properties, CMPIStatus* rc) {
  UpCall call(broker, context, path, Operation::GetInstance);
  call.request().properties = listOf(properties);
  if (call.run(rc) != CMPI_RC_OK) {
    return nullptr;
  }
  if (call.reply().instances.empty()) {
    setStatus(rc, CMPI_RC_ERR_NOT_FOUND);
    return nullptr;
  }
  return makeInstance(call.core(), std::move(call.reply().instances.front()), Origin::HandedOut);
}

CMPIObjectPath* createInstance(const CMPIBroker* broker, const CMPIContext* context,
                               const CMPIObjectPath* path, const CMPIInstance* instance,
                               CMPIStatus* rc) {
  UpCall call(broker, context, path, Operation::CreateInstance);
  const InstanceObject* object = InstanceObject::from(instance, "createInstance");
  if (object == nullptr) {
    setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
    return nullptr;
  }
  call.request().instance = object->contents.instance;
  if (call.run(rc) != CMPI_RC_OK || call.reply().paths.empty()) {
    return nullptr;
  }
  return makePath(call.core(), std::move(call.reply().paths.front()), Origin::HandedOut);
}

CMPIStatus modifyInstance(const CMPIBroker* broker, const CMPIContext* context,
                          const CMPIObjectPath* path, const CMPIInstance* instance,
                          const char** properties) {
  UpCall call(broker, context, path, Operation::ModifyInstance);
  const InstanceObject* object = InstanceObject::from(instance, "modifyInstance");
  if (object == nullptr) {
    return status(CMPI_RC_ERR_INVALID_HANDLE);
  }
  call.request().instance = object->contents.instance;
  call.request().properties = listOf(properties);
  return status(call.run());
}

CMPIStatus deleteInstance(const CMPIBroker* broker, const CMPIContext* context,
                          const CMPIObjectPath* path) {
  return status(UpCall(broker, context, path, Operation::DeleteInstance).run());
}

CMPIEnumeration* execQuery(const CMPIBroker* broker, const CMPIContext* context,
                           const CMPIObjectPath* path, const char* query, const char* language,
                           CMPIStatus* rc) {
  UpCall call(broker, context, path, Operation::ExecQuery);
  call.request().query = textOf(query);
  call.request().language = textOf(language);
  return call.instances(rc);
}

// ---- Associations ----

void fillWalk(Request& request, const char* assocClass, const char* resultClass, const char* role,
              const char* resultRole, const char** properties) {
  request.assocClass = textOf(assocClass);
  request.resultClass = textOf(resultClass);
  request.role = textOf(role);
  request.resultRole = textOf(resultRole);
  request.properties = listOf(properties);
}

CMPIEnumeration* associators(const CMPIBroker* broker, const CMPIContext* context,
                             const CMPIObjectPath* path, const char* assocClass,
                             const char* resultClass, const char* role, const char* resultRole,
                             const char** properties, CMPIStatus* rc) {
  UpCall call(broker, context, path, Operation::Associators);
  fillWalk(call.request(), assocClass, resultClass, role, resultRole, properties);
  return call.instances(rc);
}

CMPIEnumeration* associatorNames(const CMPIBroker* broker, const CMPIContext* context,
                                 const CMPIObjectPath* path, const char* assocClass,
                                 const char* resultClass, const char* role, const char* resultRole,
                                 CMPIStatus* rc) {
  UpCall call(broker, context, path, Operation::AssociatorNames);
  fillWalk(call.request(), assocClass, resultClass, role, resultRole, nullptr);
  return call.paths(rc);
}

CMPIEnumeration* references(const CMPIBroker* broker, const CMPIContext* context,
                            const CMPIObjectPath* path, const char* resultClass, const char* role,
                            const char** properties, CMPIStatus* rc) {
  UpCall call(broker, context, path, Operation::References);
  fillWalk(call.request(), nullptr, resultClass, role, nullptr, properties);
  return call.instances(rc);
}

CMPIEnumeration* referenceNames(const CMPIBroker* broker, const CMPIContext* context,
                                const CMPIObjectPath* path, const char* resultClass,
                                const char* role, CMPIStatus* rc) {
  UpCall call(broker, context, path, Operation::ReferenceNames);
  fillWalk(call.request(), nullptr, resultClass, role, nullptr, nullptr);
  return call.paths(rc);
}

// ---- Methods and single properties ----

CMPIData invokeMethod(const CMPIBroker* broker, const CMPIContext* context,
                      const CMPIObjectPath* path, const char* method, const CMPIArgs* in,
                      CMPIArgs* out, CMPIStatus* rc) {
  UpCall call(broker, context, path, Operation::InvokeMethod);
  const ArgsObject* arguments = ArgsObject::from(in, "invokeMethod");
  ArgsObject* outputs = ArgsObject::from(out, "invokeMethod");
  if (arguments == nullptr || method == nullptr) {
    return notFoundData(rc, CMPI_RC_ERR_INVALID_PARAMETER);
  }
  call.request().method = method;
  call.request().arguments = arguments->contents;
  if (call.run(rc) != CMPI_RC_OK) {
    CMPIData none{};
    none.state = CMPI_nullValue;
    return none;
  }
  if (outputs != nullptr) {
    outputs->contents = call.reply().outputs;
  }
  return toCmpi(call.core(), call.reply().returnValue);
}

CMPIStatus setProperty(const CMPIBroker* broker, const CMPIContext* context,
                       const CMPIObjectPath* path, const char* name, const CMPIValue* value,
                       CMPIType type) {
  UpCall call(broker, context, path, Operation::ModifyInstance);
  std::optional<Value> copy = fromCmpi(value, type);
  if (name == nullptr || !copy) {
    return status(CMPI_RC_ERR_INVALID_PARAMETER);
  }
  call.request().instance.path = call.request().path;
  call.request().instance.properties.set(name, std::move(*copy));
  call.request().properties = std::vector<std::string>{name};
  return status(call.run());
}

CMPIData getProperty(const CMPIBroker* broker, const CMPIContext* context,
                     const CMPIObjectPath* path, const char* name, CMPIStatus* rc) {
  UpCall call(broker, context, path, Operation::GetInstance);
  if (name == nullptr) {
    return notFoundData(rc, CMPI_RC_ERR_INVALID_PARAMETER);
  }
  call.request().properties = std::vector<std::string>{name};
  const CMPIrc code = call.run(rc);
  if (code != CMPI_RC_OK || call.reply().instances.empty()) {
    return notFoundData(rc, code != CMPI_RC_OK ? code : CMPI_RC_ERR_NOT_FOUND);
  }
  return valueNamed(call.core(), call.reply().instances.front().properties, name, rc,
                    CMPI_RC_ERR_NO_SUCH_PROPERTY);
}

CMPIBrokerFT makeTable() {
  CMPIBrokerFT table{};
  table.brokerVersion = CMPIVersion200;
  table.brokerName = "tvxcim";
  table.prepareAttachThread = prepareAttachThread;
  table.attachThread = attachThread;
  table.detachThread = detachThread;
  table.deliverIndication = deliverIndication;
  table.enumerateInstanceNames = enumerateInstanceNames;
  table.getInstance = getInstance;
  table.createInstance = createInstance;
  table.modifyInstance = modifyInstance;
  table.deleteInstance = deleteInstance;
  table.execQuery = execQuery;
  table.enumerateInstances = enumerateInstances;
  table.associators = associators;
  table.associatorNames = associatorNames;
  table.references = references;
  table.referenceNames = referenceNames;
  table.invokeMethod = invokeMethod;
  table.setProperty = setProperty;
  table.getProperty = getProperty;
  return table;
}

}  // namespace

const CMPIBrokerFT upCallTable = makeTable();

}  // namespace tvx::host
