// The instance function table.
#include "cmpi/CMPI_Operations.h"
#include "cmpi/Converter.h"
#include "cmpi/Operation_Frame.h"
#include "cmpi/Result_Delivery.h"
#include "cmpi/Status_Map.h"

namespace cimrt {

namespace {

CMPIrc code_of_conversion(int code) {
  return static_cast<CMPIrc>(code);
}

Delivery delivery_of(const CMPI_Adapter& adapter, const CMPIContext* context,
                     const CMPIResult* result, const CMPIObjectPath* path,
                     const char** properties) {
  return Delivery{adapter.broker, context, result, name_space_of(path), properties};
}

/// The model of a request: an instance of the path's class with the keys of the path.
CMPIrc make_model(const CMPI_Adapter& adapter, const CMPIObjectPath* path, Ref<Instance>& model) {
  const Meta_Class* meta_class = find_class_of_path(adapter, path);
  if (!meta_class) return CMPI_RC_ERR_FAILED;
  Instance* instance = nullptr;
  const int code = make_cimrt_reference(adapter.broker, meta_class, path, instance);
  model.reset(instance);
  return code_of_conversion(code);
}

/// The instance that a request brings.
CMPIrc take_instance(const CMPI_Adapter& adapter, const CMPIObjectPath* path,
                     const CMPIInstance* source, Ref<Instance>& out) {
  const Meta_Class* meta_class = find_class_of_path(adapter, path);
  if (!meta_class) return CMPI_RC_ERR_FAILED;
  Instance* instance = nullptr;
  const int code = make_cimrt_instance(adapter.broker, meta_class, path, source, instance);
  out.reset(instance);
  return code_of_conversion(code);
}

// ---- Enumerations

bool deliver_name(Instance* instance, std::int32_t /*status*/, void* client_data) {
  if (!instance) return false;
  const Ref<Instance> owned(instance);
  auto& delivery = *static_cast<Delivery*>(client_data);
  if (delivery.error != 0) return false;
  delivery.error = return_object_path(delivery, instance, delivery.name_space);
  return delivery.error == 0;
}

bool deliver_instance(Instance* instance, std::int32_t /*status*/, void* client_data) {
  if (!instance) return false;
  const Ref<Instance> owned(instance);
  auto& delivery = *static_cast<Delivery*>(client_data);
  if (delivery.error != 0) return false;
  CMPI_Ptr<CMPIObjectPath> path;
  delivery.error =
      make_CMPI_object_path(delivery.broker, instance, delivery.name_space, path.receive());
  if (delivery.error == 0)
    delivery.error = return_instance(delivery, instance, delivery.name_space, path.get());
  return delivery.error == 0;
}

CMPIStatus enum_instance_names(CMPIInstanceMI* mi, const CMPIContext* context,
                               const CMPIResult* result, const CMPIObjectPath* path) {
  return run_operation(mi, context, "enumInstanceNames", [&](CMPI_Adapter& adapter) -> Outcome {
    Ref<Instance> model;
    const CMPIrc made = make_model(adapter, path, model);
    if (made != CMPI_RC_OK) return made;
    nullify_properties(model.get(), false, true, true);

    Delivery delivery = delivery_of(adapter, context, result, path, nullptr);
    const std::int32_t status = adapter.call(OPERATION_ENUM_INSTANCES, adapter.provider,
                                             model.get(), &deliver_name, &delivery);
    if (status == ENUM_INSTANCES_OK) CMReturnDone(result);
    return code_of_status(Status_Family::ENUM_INSTANCES, status);
  });
}

CMPIStatus enum_instances(CMPIInstanceMI* mi, const CMPIContext* context, const CMPIResult* result,
                          const CMPIObjectPath* path, const char** properties) {
  return run_operation(mi, context, "enumInstances", [&](CMPI_Adapter& adapter) -> Outcome {
    Ref<Instance> model;
    const CMPIrc made = make_model(adapter, path, model);
    if (made != CMPI_RC_OK) return made;
    if (properties) filter_properties(model.get(), properties, true);

    Delivery delivery = delivery_of(adapter, context, result, path, properties);
    const std::int32_t status = adapter.call(OPERATION_ENUM_INSTANCES, adapter.provider,
                                             model.get(), &deliver_instance, &delivery);
    const CMPIrc code = code_of_status(Status_Family::ENUM_INSTANCES, status);
    if (code == CMPI_RC_OK) CMReturnDone(result);
    return code;
  });
}

// ---- One instance

/// Looks for the model's keys among enumerated instances.
struct Search {
  const Instance* model;
  Ref<Instance> found;
};

bool keep_match(Instance* instance, std::int32_t /*status*/, void* client_data) {
  if (!instance) return false;
  Ref<Instance> owned(instance);
  auto& search = *static_cast<Search*>(client_data);
  if (search.found) return false;
  if (!key_eq(search.model, instance)) return true;
  search.found.swap(owned);
  return false;
}

std::int32_t find_by_enumeration(const CMPI_Adapter& adapter, Ref<Instance>& model,
                                 Ref<Instance>& out) {
  Search search = {model.get(), {}};
  const std::int32_t status =
      adapter.call(OPERATION_ENUM_INSTANCES, adapter.provider, model.get(), &keep_match, &search);
  if (status != ENUM_INSTANCES_OK || !search.found) return GET_INSTANCE_NOT_FOUND;
  out.swap(search.found);
  return GET_INSTANCE_OK;
}

/// Takes over what a provider stores in an out parameter, also when it throws behind that.
class Out_Instance {
 public:
  explicit Out_Instance(Ref<Instance>& target) : _target(target) {}
  ~Out_Instance() { _target.reset(_place); }
  Out_Instance(const Out_Instance&) = delete;
  Out_Instance& operator=(const Out_Instance&) = delete;
  Instance** place() { return &_place; }

 private:
  Ref<Instance>& _target;
  Instance* _place = nullptr;
};

/// Asks the provider, which may leave the work to an enumeration.
std::int32_t find_instance(const CMPI_Adapter& adapter, Ref<Instance>& model, Ref<Instance>& out) {
  std::int32_t status = GET_INSTANCE_FAILED;
  {
    Out_Instance receiver(out);
    status = adapter.call(OPERATION_GET_INSTANCE, adapter.provider, model.get(), receiver.place());
  }
  return status == GET_INSTANCE_UNSUPPORTED ? find_by_enumeration(adapter, model, out) : status;
}

CMPIStatus get_instance(CMPIInstanceMI* mi, const CMPIContext* context, const CMPIResult* result,
                        const CMPIObjectPath* path, const char** properties) {
  return run_operation(mi, context, "getInstance", [&](CMPI_Adapter& adapter) -> Outcome {
    Ref<Instance> model;
    const CMPIrc made = make_model(adapter, path, model);
    if (made != CMPI_RC_OK) return made;
    nullify_properties(model.get(), true, true, false);
    if (properties) filter_properties(model.get(), properties, true);

    Ref<Instance> found;
    const std::int32_t status = find_instance(adapter, model, found);
    const CMPIrc code = code_of_status(Status_Family::GET_INSTANCE, status);
    if (code != CMPI_RC_OK) return code;

    const Delivery delivery = delivery_of(adapter, context, result, path, properties);
    const int returned = return_instance(delivery, found.get(), delivery.name_space, path);
    if (returned == 0) CMReturnDone(result);
    return code_of_conversion(returned);
  });
}

CMPIStatus create_instance(CMPIInstanceMI* mi, const CMPIContext* context, const CMPIResult* result,
                           const CMPIObjectPath* path, const CMPIInstance* source) {
  return run_operation(mi, context, "createInstance", [&](CMPI_Adapter& adapter) -> Outcome {
    Ref<Instance> instance;
    const CMPIrc made = take_instance(adapter, path, source, instance);
    if (made != CMPI_RC_OK) return made;

    const std::int32_t status =
        adapter.call(OPERATION_CREATE_INSTANCE, adapter.provider, instance.get());
    if (status != CREATE_INSTANCE_OK) return code_of_status(Status_Family::CREATE_INSTANCE, status);

    const Delivery delivery = delivery_of(adapter, context, result, path, nullptr);
    const int returned = return_object_path(delivery, instance.get(), delivery.name_space);
    if (returned == 0) CMReturnDone(result);
    return code_of_conversion(returned);
  });
}

CMPIStatus modify_instance(CMPIInstanceMI* mi, const CMPIContext* context, const CMPIResult* result,
                           const CMPIObjectPath* path, const CMPIInstance* source,
                           const char** properties) {
  return run_operation(mi, context, "modifyInstance", [&](CMPI_Adapter& adapter) -> Outcome {
    Ref<Instance> instance;
    const CMPIrc made = take_instance(adapter, path, source, instance);
    if (made != CMPI_RC_OK) return made;
    // What is not null in the model is what the provider is to change.
    const Ref<Instance> model(clone(instance.get()));
    filter_properties(model.get(), properties, true);

    const std::int32_t status =
        adapter.call(OPERATION_MODIFY_INSTANCE, adapter.provider, model.get(), instance.get());
    if (status != MODIFY_INSTANCE_OK) return code_of_status(Status_Family::MODIFY_INSTANCE, status);
    CMReturnObjectPath(result, path);
    CMReturnDone(result);
    return CMPI_RC_OK;
  });
}

CMPIStatus delete_instance(CMPIInstanceMI* mi, const CMPIContext* context, const CMPIResult* result,
                           const CMPIObjectPath* path) {
  return run_operation(mi, context, "deleteInstance", [&](CMPI_Adapter& adapter) -> Outcome {
    Ref<Instance> model;
    const CMPIrc made = make_model(adapter, path, model);
    if (made != CMPI_RC_OK) return made;

    const std::int32_t status =
        adapter.call(OPERATION_DELETE_INSTANCE, adapter.provider, model.get());
    const CMPIrc code = code_of_status(Status_Family::DELETE_INSTANCE, status);
    if (code == CMPI_RC_OK) CMReturnDone(result);
    return code;
  });
}

CMPIStatus exec_query(CMPIInstanceMI* mi, const CMPIContext* context, const CMPIResult* /*result*/,
                      const CMPIObjectPath* /*path*/, const char* /*query*/,
                      const char* /*language*/) {
  return run_operation(mi, context, "execQuery",
                       [](CMPI_Adapter&) -> Outcome { return CMPI_RC_ERR_NOT_SUPPORTED; });
}

CMPIStatus instance_cleanup(CMPIInstanceMI* mi, const CMPIContext* context,
                            CMPIBoolean terminating) {
  return cleanup(static_data_of(mi), context, terminating);
}

}  // namespace

void fill_instance_table(CMPIInstanceMIFT& table) {
  table.cleanup = &instance_cleanup;
  table.enumerateInstanceNames = &enum_instance_names;
  table.enumerateInstances = &enum_instances;
  table.getInstance = &get_instance;
  table.createInstance = &create_instance;
  table.modifyInstance = &modify_instance;
  table.deleteInstance = &delete_instance;
  table.execQuery = &exec_query;
}

}  // namespace cimrt
