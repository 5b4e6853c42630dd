#include "cmpi/CMPI_Thread_Context.h"

#include "cmpi/CMPI_Adapter.h"
#include "cmpi/CMPI_Containers.h"
#include "cmpi/CMPI_Object.h"
#include "cmpi/CMPI_Value.h"
#include "cmpi/Converter.h"
#include "runtime/Log.h"

namespace cimrt {

namespace {

/// State of one enumeration.
struct Enumerator {
  CMPIEnumeration* cmpi_enumeration;
  const Meta_Class* meta_class;
  Ref<Instance> current;
};

/// The next item of an enumeration, or null at its end or on any failure.
Ref<Instance> fetch(const Enumerator& enumerator) {
  if (!CMHasNext(enumerator.cmpi_enumeration, nullptr)) return {};

  CMPIStatus status = {CMPI_RC_OK, nullptr};
  const CMPIData data = CMGetNext(enumerator.cmpi_enumeration, &status);
  if (status.rc != CMPI_RC_OK || data.type != CMPI_instance || !data.value.inst) return {};
  if ((data.state & CMPI_nullValue) != 0) return {};

  const CMPIObjectPath* path = CMGetObjectPath(data.value.inst, nullptr);
  Instance* instance = nullptr;
  if (!path ||
      make_cimrt_instance(nullptr, enumerator.meta_class, path, data.value.inst, instance) != 0)
    return {};
  return Ref<Instance>(instance);
}

int answer_of(const CMPIStatus& status) {
  return status.rc == CMPI_RC_OK ? 0 : -1;
}

}  // namespace

CMPI_Thread_Context::CMPI_Thread_Context(const CMPIBroker* broker, const CMPIContext* context,
                                         CMPI_Adapter* adapter)
    : CMPI_Thread_Context(broker, context, adapter, adapter->allow_unload) {}

CMPI_Thread_Context::CMPI_Thread_Context(const CMPIBroker* broker, const CMPIContext* context,
                                         CMPI_Adapter* adapter, Unload_Flag allow_unload)
    : _broker(broker),
      _context(context),
      _adapter(adapter),
      _allow_unload(std::move(allow_unload)) {}

bool CMPI_Thread_Context::can_call(const char* name_space, const Instance* instance) const {
  return name_space && instance && _broker && _context;
}

// ---- Threads

namespace {

/// Some servers know no threads of providers; one that is started there has no up-calls.
bool can_attach(const CMPIBroker* broker) {
  return broker && broker->bft->prepareAttachThread && broker->bft->attachThread &&
         broker->bft->detachThread;
}

}  // namespace

Thread_Context* CMPI_Thread_Context::thread_create_hook(void* /*arg*/) {
  const CMPIContext* context =
      _context && can_attach(_broker) ? CBPrepareAttachThread(_broker, _context) : nullptr;
  return new CMPI_Thread_Context(_broker, context, _adapter, _allow_unload);
}

void CMPI_Thread_Context::thread_start_hook() {
  if (_context) CBAttachThread(_broker, _context);
}

void CMPI_Thread_Context::thread_exit_hook() {
  // The server frees the thread's context with its detaching.
  if (_context) CBDetachThread(_broker, std::exchange(_context, nullptr));
}

// ---- Enumerations

void* CMPI_Thread_Context::instance_enumerator_create(const char* name_space,
                                                      const Instance* model) {
  if (!can_call(name_space, model)) return nullptr;
  CMPI_Ptr<CMPIObjectPath> path;
  if (make_CMPI_object_path(_broker, model, name_space, path.receive()) != 0) return nullptr;

  CMPIStatus status = {CMPI_RC_OK, nullptr};
  CMPIEnumeration* items = CBEnumInstances(_broker, _context, path.get(), nullptr, &status);
  if (status.rc != CMPI_RC_OK || !items) return nullptr;

  auto enumerator = std::make_unique<Enumerator>();
  enumerator->cmpi_enumeration = items;
  enumerator->meta_class = class_of(model);
  enumerator->current = fetch(*enumerator);
  return enumerator.release();
}

void CMPI_Thread_Context::instance_enumerator_destroy(void* enumerator) {
  delete static_cast<Enumerator*>(enumerator);
}

bool CMPI_Thread_Context::instance_enumerator_more(void* enumerator) {
  return enumerator && static_cast<Enumerator*>(enumerator)->current;
}

void CMPI_Thread_Context::instance_enumerator_next(void* enumerator) {
  if (!enumerator) return;
  auto* state = static_cast<Enumerator*>(enumerator);
  state->current = fetch(*state);
}

Ref<Instance> CMPI_Thread_Context::instance_enumerator_get(void* enumerator) {
  return enumerator ? static_cast<Enumerator*>(enumerator)->current : Ref<Instance>();
}

// ---- Instances

Ref<Instance> CMPI_Thread_Context::get_instance(const char* name_space, const Instance* model) {
  if (!can_call(name_space, model)) return {};
  CMPI_Ptr<CMPIObjectPath> path;
  if (make_CMPI_object_path(_broker, model, name_space, path.receive()) != 0) return {};

  CMPIStatus status = {CMPI_RC_OK, nullptr};
  CMPIInstance* found = CBGetInstance(_broker, _context, path.get(), nullptr, &status);
  if (status.rc != CMPI_RC_OK || !found) return {};

  CMPI_Ptr<CMPIInstance> owned(found);
  Instance* instance = nullptr;
  if (make_cimrt_instance(nullptr, class_of(model), path.get(), found, instance) != 0) return {};
  return Ref<Instance>(instance);
}

int CMPI_Thread_Context::create_instance(const char* name_space, const Instance* instance) {
  if (!can_call(name_space, instance)) return -1;
  CMPI_Ptr<CMPIObjectPath> path;
  CMPI_Ptr<CMPIInstance> made;
  if (make_CMPI_object_path(_broker, instance, name_space, path.receive()) != 0) return -1;
  if (make_CMPI_instance(_broker, instance, name_space, path.get(), nullptr, made.receive()) != 0)
    return -1;
  CMPIStatus status = {CMPI_RC_OK, nullptr};
  CMPI_Ptr<CMPIObjectPath> created(
      CBCreateInstance(_broker, _context, path.get(), made.get(), &status));
  return answer_of(status);
}

int CMPI_Thread_Context::delete_instance(const char* name_space, const Instance* instance) {
  if (!can_call(name_space, instance)) return -1;
  CMPI_Ptr<CMPIObjectPath> path;
  if (make_CMPI_object_path(_broker, instance, name_space, path.receive()) != 0) return -1;
  return answer_of(CBDeleteInstance(_broker, _context, path.get()));
}

int CMPI_Thread_Context::modify_instance(const char* name_space, const Instance* instance) {
  if (!can_call(name_space, instance)) return -1;
  CMPI_Ptr<CMPIObjectPath> path;
  CMPI_Ptr<CMPIInstance> made;
  if (make_CMPI_object_path(_broker, instance, name_space, path.receive()) != 0) return -1;
  if (make_CMPI_instance(_broker, instance, name_space, path.get(), nullptr, made.receive()) != 0)
    return -1;
  return answer_of(CBModifyInstance(_broker, _context, path.get(), made.get(), nullptr));
}

// ---- Methods

namespace {

/// One call of a method of another provider, step by step. Each step answers false, logged, if it
/// fails.
class Method_Call {
 public:
  Method_Call(const CMPIBroker* broker, const CMPIContext* context, const char* name_space,
              const Instance* instance, Instance* method)
      : _broker(broker),
        _context(context),
        _name_space(name_space),
        _instance(instance),
        _method(method) {}

  int run() {
    return check() && make_path() && make_input() && invoke() && take_output() && take_return()
               ? 0
               : -1;
  }

 private:
  static bool failed() {
    CIMRT_TRACE(LOG_WARN_, "failed");
    return false;
  }

  bool check() {
    if (!_name_space || !_instance || !_method || !_instance->meta_class) return failed();
    const Meta_Class* meta_class = class_of(_instance);
    _repository = meta_class ? meta_class->meta_repository : nullptr;
    return _repository && _broker && _context && _method->meta_class &&
                   is_method(_method->meta_class)
               ? true
               : failed();
  }

  bool make_path() {
    int result = 0;
    if ((_method->meta_class->flags & FLAG_STATIC) != 0)
      _path.reset(CMNewObjectPath(_broker, _name_space, _instance->meta_class->name, nullptr));
    else
      result = make_CMPI_object_path(_broker, _instance, _name_space, _path.receive());
    return result == 0 && _path ? true : failed();
  }

  bool make_input() {
    _in.reset(CMNewArgs(_broker, nullptr));
    if (!_in) return failed();
    CMPIArgs_Container container(_repository, _broker, _name_space, _in.get());
    return container.convert(_method, FLAG_IN) == 0 ? true : failed();
  }

  bool invoke() {
    _out.reset(CMNewArgs(_broker, nullptr));
    if (!_out) return failed();
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    _return = CBInvokeMethod(_broker, _context, _path.get(), _method->meta_class->name, _in.get(),
                             _out.get(), &status);
    if (status.rc == CMPI_RC_OK) return true;
    CIMRT_TRACE(LOG_WARN_, "failed[%u]", static_cast<unsigned>(status.rc));
    return false;
  }

  bool take_output() {
    CMPIArgs_Container container(_repository, _broker, _name_space, _out.get());
    Instance* record = _method;
    if (container.convert(_method->meta_class, FLAG_OUT, record) != 0 || !record) return failed();
    const char* name_space = name_space_of(_path.get());
    record->__name_space = name_space;
    set_name_space(record, name_space, false);
    return true;
  }

  bool take_return() {
    Value value;
    if (cmpi_to_cimrt_value(_repository, _broker, _name_space, _return, value) != 0)
      return failed();
    const Meta_Feature* feature = find_feature(_method->meta_class, "return_value", FLAG_PROPERTY);
    return feature && value.set(_method, feature) == 0 ? true : failed();
  }

  const CMPIBroker* _broker;
  const CMPIContext* _context;
  const char* _name_space;
  const Instance* _instance;
  Instance* _method;
  const Meta_Repository* _repository = nullptr;
  CMPI_Ptr<CMPIObjectPath> _path;
  CMPI_Ptr<CMPIArgs> _in;
  CMPI_Ptr<CMPIArgs> _out;
  CMPIData _return{};
};

}  // namespace

int CMPI_Thread_Context::invoke_method(const char* name_space, const Instance* instance,
                                       Instance* method) {
  return Method_Call(_broker, _context, name_space, instance, method).run();
}

// ---- The request and the adapter

void CMPI_Thread_Context::allow_unload(bool flag) {
  _allow_unload->store(flag);
}

bool CMPI_Thread_Context::get_username(String& name) {
  CMPIStatus status = {CMPI_RC_ERR_FAILED, nullptr};
  CMPIData data = {};
  if (_context) data = CMGetContextEntry(_context, CMPIPrincipal, &status);
  if (status.rc == CMPI_RC_OK) {
    const bool text = data.type == CMPI_string && (data.state & CMPI_nullValue) == 0;
    name = String(text ? text_of(data.value.string) : "");
    return true;
  }
  CIMRT_TRACE(LOG_ERR_, "username not OK cmpirc=%d", static_cast<int>(status.rc));
  return false;
}

}  // namespace cimrt
