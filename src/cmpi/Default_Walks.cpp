#include "cmpi/Default_Walks.h"

#include "cmpi/CMPI_Operations.h"

namespace cimrt {

namespace {

/// The adapter's class if it is an association, else null.
const Meta_Class* own_association(const CMPI_Adapter& adapter) {
  const Meta_Class* meta_class = own_class(adapter);
  return meta_class && (meta_class->flags & FLAG_ASSOCIATION) != 0 ? meta_class : nullptr;
}

struct References_Walk {
  const Instance* source;
  String role;
  Instance_Handler handler;
};

bool walk_references(Instance* association, std::int32_t /*status*/, void* client_data) {
  if (!association) return false;
  Ref<Instance> owned(association);
  const auto& walk = *static_cast<References_Walk*>(client_data);
  if (is_reference_of(walk.source, association, walk.role)) walk.handler.handle(owned.release());
  return true;
}

struct Associators_Walk {
  const Instance* source;
  Associator_Filter filter;
  Instance_Handler handler;
};

bool walk_associators(Instance* association, std::int32_t /*status*/, void* client_data) {
  if (!association) return false;
  const Ref<Instance> owned(association);
  const auto& walk = *static_cast<Associators_Walk*>(client_data);
  Instance* targets[MAX_ASSOCIATORS] = {};
  const int found = get_associators(walk.source, association, walk.filter.result_class,
                                    walk.filter.role, walk.filter.result_role, targets);
  for (int i = 0; i < found; ++i) {
    ref(targets[i]);
    walk.handler.handle(targets[i]);
  }
  return true;
}

}  // namespace

std::int32_t default_references(const CMPI_Adapter& adapter, const Instance* source,
                                const Instance* model, const String& role, Instance_Proc handler,
                                void* client_data) {
  if (!own_association(adapter)) return ENUM_REFERENCES_FAILED;

  std::int32_t status = adapter.call(OPERATION_ENUM_REFERENCES, adapter.provider, source, model,
                                     &role, handler, client_data);
  if (status == ENUM_REFERENCES_OK || status == ENUM_REFERENCES_FAILED ||
      status == ENUM_REFERENCES_ACCESS_DENIED)
    return status;

  References_Walk walk = {source, role, {handler, client_data}};
  status = adapter.call(OPERATION_ENUM_INSTANCES, adapter.provider, model, &walk_references, &walk);
  handler(nullptr, 0, client_data);
  if (status == ENUM_INSTANCES_FAILED) return ENUM_REFERENCES_FAILED;
  if (status == ENUM_INSTANCES_ACCESS_DENIED) return ENUM_REFERENCES_ACCESS_DENIED;
  return ENUM_REFERENCES_OK;
}

std::int32_t default_associators(const CMPI_Adapter& adapter, const Instance* source,
                                 const Associator_Filter& filter, Instance_Proc handler,
                                 void* client_data) {
  const Meta_Class* meta_class = own_association(adapter);
  if (!meta_class) return ENUM_ASSOCIATOR_NAMES_FAILED;

  std::int32_t status =
      adapter.call(OPERATION_ENUM_ASSOCIATOR_NAMES, adapter.provider, source, &filter.result_class,
                   &filter.role, &filter.result_role, handler, client_data);
  if (status == ENUM_ASSOCIATOR_NAMES_OK) return status;
  // Unlike the walk of the references, this one does not tell a denied access from a failure.
  if (status == ENUM_ASSOCIATOR_NAMES_FAILED || status == ENUM_ASSOCIATOR_NAMES_ACCESS_DENIED)
    return ENUM_ASSOCIATOR_NAMES_FAILED;

  const Ref<Instance> model(create(meta_class, false));
  nullify_properties(model.get(), false, true, true);
  Associators_Walk walk = {source, filter, {handler, client_data}};
  status = adapter.call(OPERATION_ENUM_INSTANCES, adapter.provider, model.get(), &walk_associators,
                        &walk);
  handler(nullptr, 0, client_data);
  if (status == ENUM_INSTANCES_FAILED) return ENUM_ASSOCIATOR_NAMES_FAILED;
  if (status == ENUM_INSTANCES_ACCESS_DENIED) return ENUM_ASSOCIATOR_NAMES_ACCESS_DENIED;
  return ENUM_ASSOCIATOR_NAMES_OK;
}

}  // namespace cimrt
