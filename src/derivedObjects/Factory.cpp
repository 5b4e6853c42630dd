#include "derivedObjects/Factory.h"

#include "cmpi/CMPI_Adapter.h"

namespace cimrt {

namespace {

constinit CMPI_Static_Data static_data[num_provider_classes];

}  // namespace

void* make_interface(std::size_t index, const CMPIBroker* broker, const CMPIContext* context,
                     char letter) noexcept {
  const Provider_Entry& entry = provider_entries[index];
  void* result = nullptr;
  cimrt_cmpi_adapter('C', &static_data[index], &entry, broker, context, entry.provider_name, letter,
                     &result);
  return result;
}

}  // namespace cimrt

const cimrt::Registration* cimrt_module() noexcept {
  return &cimrt::provider_entries[cimrt::num_provider_classes - 1];
}
