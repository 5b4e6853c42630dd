// Any text is either refused or read into an instance that can be copied, written and released.
#include "Expect.h"
#include "Test_Schema.h"

using namespace cimrt;

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string text = fuzz::text_of(data, size);
  const Ref<Instance> instance(
      model_path_to_instance(&test::T_Device::static_meta_class, text.c_str()));
  if (!instance) return 0;
  const Ref<Instance> copy(clone(instance.get()));
  fuzz::expect(key_eq(copy.get(), instance.get()));
  String written;
  instance_to_model_path(instance.get(), written);
  return 0;
}
