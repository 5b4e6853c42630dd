// The association function table.
#include "cmpi/CMPI_Operations.h"
#include "cmpi/Converter.h"
#include "cmpi/Default_Walks.h"
#include "cmpi/Operation_Frame.h"
#include "cmpi/Result_Delivery.h"
#include "cmpi/Status_Map.h"

namespace cimrt {

namespace {

/// Namespace of a far end: its own if it has one, otherwise that of the request.
const char* name_space_for(const Delivery& delivery, const Instance* instance) {
  return instance->__name_space.empty() ? delivery.name_space : instance->__name_space.c_str();
}

// ---- Callbacks. Each takes its instance over and stays quiet once something went wrong.

bool deliver_associator_name(Instance* instance, std::int32_t /*status*/, void* client_data) {
  if (!instance) return false;
  const Ref<Instance> owned(instance);
  auto& delivery = *static_cast<Delivery*>(client_data);
  if (delivery.error != 0) return false;
  delivery.error = return_object_path(delivery, instance, name_space_for(delivery, instance));
  return delivery.error == 0;
}

/// For instances that the provider made itself.
bool deliver_associator(Instance* instance, std::int32_t /*status*/, void* client_data) {
  if (!instance) return false;
  const Ref<Instance> owned(instance);
  auto& delivery = *static_cast<Delivery*>(client_data);
  if (delivery.error != 0) return true;
  if (return_instance(delivery, instance, name_space_for(delivery, instance), nullptr) != 0)
    delivery.error = 1;
  return true;
}

/// For far ends that only their path is known of: the server is asked for the instance.
bool fetch_associator(Instance* instance, std::int32_t /*status*/, void* client_data) {
  if (!instance) return false;
  const Ref<Instance> owned(instance);
  auto& delivery = *static_cast<Delivery*>(client_data);
  if (delivery.error != 0) return true;
  CMPI_Ptr<CMPIObjectPath> path;
  delivery.error = make_CMPI_object_path(delivery.broker, instance,
                                         name_space_for(delivery, instance), path.receive());
  if (delivery.error != 0) return true;
  CMPI_Ptr<CMPIInstance> fetched(
      CBGetInstance(delivery.broker, delivery.context, path.get(), delivery.properties, nullptr));
  if (!fetched) {
    delivery.error = 1;
    return false;
  }
  CMReturnInstance(delivery.result, fetched.get());
  return true;
}

bool deliver_reference_name(Instance* instance, std::int32_t /*status*/, void* client_data) {
  if (!instance) return false;
  const Ref<Instance> owned(instance);
  auto& delivery = *static_cast<Delivery*>(client_data);
  if (delivery.error != 0) return false;
  nullify_properties(instance, false, true, true);
  delivery.error = return_object_path(delivery, instance, delivery.name_space);
  return delivery.error == 0;
}

bool deliver_reference(Instance* instance, std::int32_t /*status*/, void* client_data) {
  if (!instance) return false;
  const Ref<Instance> owned(instance);
  auto& delivery = *static_cast<Delivery*>(client_data);
  if (delivery.error != 0) return true;
  CMPI_Ptr<CMPIObjectPath> path;
  delivery.error =
      make_CMPI_object_path(delivery.broker, instance, delivery.name_space, path.receive());
  if (delivery.error != 0) return true;
  filter_properties(instance, delivery.properties, false);
  delivery.error = return_instance(delivery, instance, delivery.name_space, path.get());
  return true;
}

// ---- Operations

/// One association query: its source object and where the answers go.
struct Query {
  CMPI_Adapter& adapter;
  const CMPIContext* context;
  const CMPIResult* result;
  const CMPIObjectPath* path;
  const char** properties = nullptr;
  Ref<Instance> source{};
  Delivery delivery{};

  /// Finds the class of the source and makes its model; an outcome if the query ends with that. An
  /// unknown class is an empty success, whatever `logged` says in its return line.
  bool prepare(CMPIrc logged, Outcome& outcome) {
    delivery = Delivery{adapter.broker, context, result, name_space_of(path), properties};
    const Meta_Class* meta_class = find_class_of_path(adapter, path);
    if (!meta_class) {
      outcome = CMPI_RC_OK;
      outcome.logged = logged;
      return false;
    }
    Instance* made = nullptr;
    const int code = make_cimrt_reference(adapter.broker, meta_class, path, made);
    source.reset(made);
    outcome = static_cast<CMPIrc>(code);
    return code == 0;
  }

  Outcome references(const String& role, bool keys_only, Instance_Proc handler) {
    const Meta_Class* meta_class = own_class(adapter);
    const Ref<Instance> model(meta_class ? create(meta_class, false) : nullptr);
    if (!model) return CMPI_RC_ERR_FAILED;
    if (keys_only) nullify_properties(model.get(), false, true, true);
    const std::int32_t status =
        default_references(adapter, source.get(), model.get(), role, handler, &delivery);
    return code_of_status(Status_Family::ENUM_REFERENCES, status);
  }

  Outcome associators_by_walk(const Associator_Filter& filter, Instance_Proc handler) {
    const std::int32_t status =
        default_associators(adapter, source.get(), filter, handler, &delivery);
    return code_of_status(Status_Family::ENUM_ASSOCIATOR_NAMES, status);
  }

  Outcome associators(const Associator_Filter& filter) {
    const std::int32_t status = adapter.call(OPERATION_ENUM_ASSOCIATORS, adapter.provider,
                                             source.get(), &filter.result_class, &filter.role,
                                             &filter.result_role, &deliver_associator, &delivery);
    const CMPIrc code = code_of_status(Status_Family::ENUM_ASSOCIATORS, status);
    if (status == ENUM_ASSOCIATORS_OK || code != CMPI_RC_OK) return code;
    return associators_by_walk(filter, &fetch_associator);
  }
};

CMPIStatus associators(CMPIAssociationMI* mi, const CMPIContext* context, const CMPIResult* result,
                       const CMPIObjectPath* path, const char* /*association_class*/,
                       const char* result_class, const char* role, const char* result_role,
                       const char** properties) {
  return run_operation(mi, context, "associators", [&](CMPI_Adapter& adapter) -> Outcome {
    const Associator_Filter filter = {result_class, role, result_role};
    Query query = {adapter, context, result, path, properties};
    Outcome outcome(CMPI_RC_OK);
    return query.prepare(CMPI_RC_OK, outcome) ? query.associators(filter) : outcome;
  });
}

CMPIStatus associator_names(CMPIAssociationMI* mi, const CMPIContext* context,
                            const CMPIResult* result, const CMPIObjectPath* path,
                            const char* /*association_class*/, const char* result_class,
                            const char* role, const char* result_role) {
  return run_operation(mi, context, "associatorNames", [&](CMPI_Adapter& adapter) -> Outcome {
    const Associator_Filter filter = {result_class, role, result_role};
    Query query = {adapter, context, result, path};
    Outcome outcome(CMPI_RC_OK);
    return query.prepare(CMPI_RC_ERR_INVALID_CLASS, outcome)
               ? query.associators_by_walk(filter, &deliver_associator_name)
               : outcome;
  });
}

CMPIStatus references(CMPIAssociationMI* mi, const CMPIContext* context, const CMPIResult* result,
                      const CMPIObjectPath* path, const char* /*result_class*/, const char* role,
                      const char** properties) {
  return run_operation(mi, context, "references", [&](CMPI_Adapter& adapter) -> Outcome {
    Query query = {adapter, context, result, path, properties};
    Outcome outcome(CMPI_RC_OK);
    return query.prepare(CMPI_RC_ERR_INVALID_CLASS, outcome)
               ? query.references(role, false, &deliver_reference)
               : outcome;
  });
}

CMPIStatus reference_names(CMPIAssociationMI* mi, const CMPIContext* context,
                           const CMPIResult* result, const CMPIObjectPath* path,
                           const char* /*result_class*/, const char* role) {
  return run_operation(mi, context, "referenceNames", [&](CMPI_Adapter& adapter) -> Outcome {
    Query query = {adapter, context, result, path};
    Outcome outcome(CMPI_RC_OK);
    return query.prepare(CMPI_RC_ERR_INVALID_CLASS, outcome)
               ? query.references(role, true, &deliver_reference_name)
               : outcome;
  });
}

CMPIStatus association_cleanup(CMPIAssociationMI* mi, const CMPIContext* context,
                               CMPIBoolean terminating) {
  return cleanup(static_data_of(mi), context, terminating);
}

}  // namespace

void fill_association_table(CMPIAssociationMIFT& table) {
  table.cleanup = &association_cleanup;
  table.associators = &associators;
  table.associatorNames = &associator_names;
  table.references = &references;
  table.referenceNames = &reference_names;
}

}  // namespace cimrt
