#include "cmpi/Converter.h"

#include <new>

#include "cmpi/CMPI_Containers.h"
#include "cmpi/CMPI_Object.h"
#include "runtime/Log.h"

namespace cimrt {

namespace {

constexpr int CONVERSION_FAILED = CMPI_RC_ERR_FAILED;

/// Repository of the instance's class; call records of methods have none.
const Meta_Repository* repository_of(const Instance* instance) {
  const Meta_Class* meta_class = class_of(instance);
  return meta_class ? meta_class->meta_repository : nullptr;
}

/// Converts into a new instance; null if there is no memory for it.
Ref<Instance> convert(Container& container, const Meta_Record* record, std::uint32_t flags) {
  try {
    Instance* instance = nullptr;
    const int code = container.convert(record, flags, instance);
    Ref<Instance> made(instance);
    return code == 0 ? made : Ref<Instance>();
  } catch (const std::bad_alloc&) {
    return {};
  }
}

/// Reads a container into a new instance and gives it the namespace of `path`.
int read(Container& container, const Meta_Record* record, std::uint32_t flags,
         const char* name_space, Instance*& out) {
  Ref<Instance> made = convert(container, record, flags);
  if (!made) return CONVERSION_FAILED;
  set_name_space(made.get(), name_space, false);
  out = made.release();
  return 0;
}

}  // namespace

int make_cimrt_reference(const CMPIBroker* broker, const Meta_Class* meta_class,
                         const CMPIObjectPath* path, Instance*& out) {
  const char* name_space = name_space_of(path);
  CMPIObjectPath_Container container(meta_class->meta_repository, broker, name_space, path);
  return read(container, meta_class, FLAG_KEY, name_space, out);
}

int make_cimrt_instance(const CMPIBroker* broker, const Meta_Class* meta_class,
                        const CMPIObjectPath* path, const CMPIInstance* instance, Instance*& out) {
  const char* name_space = name_space_of(path);
  CMPIInstance_Container container(meta_class->meta_repository, broker, name_space, instance);
  return read(container, meta_class, 0, name_space, out);
}

int make_cimrt_method(const CMPIBroker* broker, const Meta_Class* meta_class,
                      const Meta_Method* meta_method, const CMPIObjectPath* path,
                      const CMPIArgs* args, CMPI_Adapter* /*adapter*/, Instance*& out) {
  const char* name_space = name_space_of(path);
  CMPIArgs_Container container(meta_class->meta_repository, broker, name_space, args);
  return read(container, meta_method, FLAG_IN, name_space, out);
}

int make_CMPI_object_path(const CMPIBroker* broker, const Instance* instance,
                          const char* name_space, CMPIObjectPath*& out) {
  out = nullptr;
  if (!instance) return CONVERSION_FAILED;
  CMPIStatus status = {CMPI_RC_OK, nullptr};
  CMPI_Ptr<CMPIObjectPath> path(
      CMNewObjectPath(broker, name_space, instance->meta_class->name, &status));
  if (!path || status.rc != CMPI_RC_OK) return CONVERSION_FAILED;

  CMPIObjectPath_Container container(repository_of(instance), broker, name_space, path.get());
  if (container.convert(instance, FLAG_KEY) != 0) return CONVERSION_FAILED;
  out = path.release();
  return 0;
}

int make_CMPI_instance(const CMPIBroker* broker, const Instance* instance, const char* name_space,
                       const CMPIObjectPath* path, const char** properties, CMPIInstance*& out) {
  out = nullptr;
  CMPI_Ptr<CMPIObjectPath> own_path;
  if (!path) {
    CIMRT_TRACE(LOG_WARN_, "No ObjectPath built before call to make_CMPI_instance");
    if (make_CMPI_object_path(broker, instance, name_space, own_path.receive()) != 0)
      return CONVERSION_FAILED;
    path = own_path.get();
  }
  CMPIStatus status = {CMPI_RC_OK, nullptr};
  CMPI_Ptr<CMPIInstance> made(CMNewInstance(broker, path, &status));
  if (!made || status.rc != CMPI_RC_OK) return CONVERSION_FAILED;
  if (properties) {
    status = CMSetPropertyFilter(made.get(), properties, nullptr);
    if (status.rc != CMPI_RC_OK) return status.rc;
  }
  CMPIInstance_Container container(instance ? repository_of(instance) : nullptr, broker, name_space,
                                   made.get());
  if (container.convert(instance, 0) != 0) return CONVERSION_FAILED;
  out = made.release();
  return 0;
}

int make_CMPI_method(const CMPIBroker* broker, const char* name_space, const Instance* method,
                     CMPIArgs* args, CMPIValue& data, CMPIType& type) {
  CMPIArgs_Container container(nullptr, broker, name_space, args);
  if (container.convert(method, FLAG_OUT) != 0) return CONVERSION_FAILED;
  data = container.return_value().value;
  type = container.return_value().type;
  return 0;
}

}  // namespace cimrt
