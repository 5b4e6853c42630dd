#include "cmpi/Result_Delivery.h"

#include "cmpi/Converter.h"

namespace cimrt {

int return_object_path(const Delivery& delivery, const Instance* instance, const char* name_space) {
  CMPI_Ptr<CMPIObjectPath> path;
  const int code = make_CMPI_object_path(delivery.broker, instance, name_space, path.receive());
  if (code != 0) return code;
  CMReturnObjectPath(delivery.result, path.get());
  return 0;
}

int return_instance(const Delivery& delivery, const Instance* instance, const char* name_space,
                    const CMPIObjectPath* path) {
  CMPI_Ptr<CMPIInstance> made;
  const int code = make_CMPI_instance(delivery.broker, instance, name_space, path,
                                      delivery.properties, made.receive());
  if (code != 0) return code;
  CMReturnInstance(delivery.result, made.get());
  return 0;
}

}  // namespace cimrt
