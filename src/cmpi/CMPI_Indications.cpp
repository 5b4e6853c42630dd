// The indication function table. No class exports an interface with it, but the bridge is complete.
#include "cmpi/CMPI_Object.h"
#include "cmpi/CMPI_Operations.h"
#include "cmpi/Converter.h"
#include "cmpi/Operation_Frame.h"
#include "cmpi/Status_Map.h"

namespace cimrt {

namespace {

void construct_filter(void* to, const void* from) {
  new (to) Indication_Filter(*static_cast<const Indication_Filter*>(from));
}

void destroy_filter(void* element) {
  static_cast<Indication_Filter*>(element)->~Indication_Filter();
}

bool equal_filters(const void* a, const void* b) {
  const auto* left = static_cast<const Indication_Filter*>(a);
  const auto* right = static_cast<const Indication_Filter*>(b);
  return left->name_space == right->name_space && left->count == right->count;
}

}  // namespace

const Array_Traits indication_filter_traits = {sizeof(Indication_Filter), construct_filter,
                                               destroy_filter, equal_filters};

namespace {

/// Position of a namespace among the active filters, or their number if it is not there.
std::size_t find_filter(const Array<Indication_Filter>& filters, const char* name_space) {
  std::size_t i = 0;
  while (i < filters.size() && !filters[i].name_space.equal(name_space)) ++i;
  return i;
}

void deliver_to(const CMPI_Thread_Context& context, const Instance* instance,
                const char* name_space) {
  CMPI_Ptr<CMPIInstance> indication;
  if (make_CMPI_instance(context.broker(), instance, name_space, nullptr, nullptr,
                         indication.receive()) == 0)
    CBDeliverIndication(context.broker(), context.context(), name_space, indication.get());
}

CMPIStatus authorize_filter(CMPIIndicationMI*, const CMPIContext*, const CMPISelectExp*,
                            const char*, const CMPIObjectPath*, const char*) {
  return status_of(CMPI_RC_OK);
}

CMPIStatus must_poll(CMPIIndicationMI*, const CMPIContext*, const CMPIResult*, const CMPISelectExp*,
                     const char*, const CMPIObjectPath*) {
  return status_of(CMPI_RC_OK);
}

CMPIStatus activate_filter(CMPIIndicationMI* mi, const CMPIContext* context, const CMPISelectExp*,
                           const char*, const CMPIObjectPath* path, CMPIBoolean) {
  return run_operation(mi, context, "activateFilter", [&](CMPI_Adapter& adapter) -> Outcome {
    const String name_space(name_space_of(path));
    Array<Indication_Filter>& filters = adapter.indication_filters;
    const std::size_t i = find_filter(filters, name_space.c_str());
    if (i < filters.size())
      ++filters[i].count;
    else
      filters.append(Indication_Filter{name_space, 1});
    return CMPI_RC_OK;
  });
}

CMPIStatus deactivate_filter(CMPIIndicationMI* mi, const CMPIContext* context, const CMPISelectExp*,
                             const char*, const CMPIObjectPath* path, CMPIBoolean) {
  return run_operation(mi, context, "deactivateFilter", [&](CMPI_Adapter& adapter) -> Outcome {
    Array<Indication_Filter>& filters = adapter.indication_filters;
    const std::size_t i = find_filter(filters, name_space_of(path));
    if (i < filters.size() && --filters[i].count == 0) filters.remove(i, 1);
    return CMPI_RC_OK;
  });
}

CMPIStatus enable_indications(CMPIIndicationMI* mi, const CMPIContext* context) {
  return run_operation(mi, context, "enableIndications", [](CMPI_Adapter& adapter) -> Outcome {
    if (adapter.indications_enabled) return CMPI_RC_OK;
    adapter.indications_enabled = true;
    const std::int32_t status =
        adapter.call(OPERATION_ENABLE_INDICATIONS, adapter.provider, &_indication_proc, &adapter);
    return code_of_status(Status_Family::ENABLE_INDICATIONS, status);
  });
}

CMPIStatus disable_indications(CMPIIndicationMI* mi, const CMPIContext* context) {
  return run_operation(mi, context, "disableIndications", [](CMPI_Adapter& adapter) -> Outcome {
    if (!adapter.indications_enabled) return CMPI_RC_OK;
    const std::int32_t status = adapter.call(OPERATION_DISABLE_INDICATIONS, adapter.provider);
    adapter.indications_enabled = false;
    return code_of_status(Status_Family::DISABLE_INDICATIONS, status);
  });
}

CMPIStatus indication_cleanup(CMPIIndicationMI* mi, const CMPIContext* context,
                              CMPIBoolean terminating) {
  CIMRT_TRACE(LOG_DBG_, "enter: %s()", "indicationCleanup");
  return cleanup(static_data_of(mi), context, terminating);
}

}  // namespace

bool _indication_proc(Instance* instance, std::int32_t /*status*/, void* client_data) {
  if (!instance) return false;
  const Ref<Instance> owned(instance);
  auto* thread_context = static_cast<CMPI_Thread_Context*>(Thread_Context::top());
  CIMRT_ASSERT(thread_context !=
               0);  // NOLINT(modernize-use-nullptr): the text is known to operators

  auto& adapter = *static_cast<CMPI_Adapter*>(client_data);
  const Auto_Mutex locked(adapter.lock);
  for (const Indication_Filter& filter : adapter.indication_filters)
    deliver_to(*thread_context, instance, filter.name_space.c_str());
  return true;
}

void fill_indication_table(CMPIIndicationMIFT& table) {
  table.cleanup = &indication_cleanup;
  table.authorizeFilter = &authorize_filter;
  table.mustPoll = &must_poll;
  table.activateFilter = &activate_filter;
  table.deActivateFilter = &deactivate_filter;
  table.enableIndications = &enable_indications;
  table.disableIndications = &disable_indications;
}

}  // namespace cimrt
