// The method function table.
#include "cmpi/CMPI_Object.h"
#include "cmpi/CMPI_Operations.h"
#include "cmpi/Converter.h"
#include "cmpi/Operation_Frame.h"
#include "cmpi/Status_Map.h"

namespace cimrt {

namespace {

/// One call of a method, from the request's objects to the provider and back.
struct Method_Request {
  CMPI_Adapter& adapter;
  const CMPIResult* result;
  const CMPIObjectPath* path;
  const char* name;
  const CMPIArgs* in;
  CMPIArgs* out;

  Outcome run() const {
    const Meta_Class* meta_class = find_class_of_path(adapter, path);
    if (!meta_class) return {CMPI_RC_ERR_FAILED, "MetaClass not found"};
    const Meta_Method* method = find_method(meta_class, name);
    if (!method) return {CMPI_RC_ERR_METHOD_NOT_FOUND, name};
    if (name_eq(class_name_of(path), method->name)) return CMPI_RC_ERR_INVALID_CLASS;
    return call(meta_class, method);
  }

 private:
  Outcome call(const Meta_Class* meta_class, const Meta_Method* method) const {
    Instance* made = nullptr;
    int code = make_cimrt_reference(adapter.broker, meta_class, path, made);
    const Ref<Instance> model(made);
    if (code != 0) return {static_cast<CMPIrc>(code), "CIMRT reference creation failed"};

    made = nullptr;
    code = make_cimrt_method(adapter.broker, meta_class, method, path, in, &adapter, made);
    const Ref<Instance> record(made);
    if (code != 0) return {static_cast<CMPIrc>(code), "CIMRT make_cimrt_method function failed"};

    const std::int32_t status =
        adapter.call(OPERATION_INVOKE_METHOD, adapter.provider, model.get(), record.get());
    const CMPIrc refused = code_of_status(Status_Family::INVOKE_METHOD, status);
    return refused != CMPI_RC_OK ? Outcome(refused) : answer(record.get());
  }

  Outcome answer(const Instance* record) const {
    CMPIValue value = {};
    CMPIType type = CMPI_null;
    const int code =
        make_CMPI_method(adapter.broker, name_space_of(path), record, out, value, type);
    if (code != 0) return static_cast<CMPIrc>(code);
    CMReturnData(result, &value, type);
    CMReturnDone(result);
    return CMPI_RC_OK;
  }
};

CMPIStatus invoke_method(CMPIMethodMI* mi, const CMPIContext* context, const CMPIResult* result,
                         const CMPIObjectPath* path, const char* method, const CMPIArgs* in,
                         CMPIArgs* out) {
  return run_operation(mi, context, "invokeMethod", [&](CMPI_Adapter& adapter) -> Outcome {
    return Method_Request{adapter, result, path, method ? method : "", in, out}.run();
  });
}

CMPIStatus method_cleanup(CMPIMethodMI* mi, const CMPIContext* context, CMPIBoolean terminating) {
  return cleanup(static_data_of(mi), context, terminating);
}

}  // namespace

void fill_method_table(CMPIMethodMIFT& table) {
  table.cleanup = &method_cleanup;
  table.invokeMethod = &invoke_method;
}

}  // namespace cimrt
