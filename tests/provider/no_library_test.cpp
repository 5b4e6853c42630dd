// A machine without any management library: every load is refused, every class answers empty.
#include <dlfcn.h>

#include <string>

#include "Provider_Fixture.h"
#include "runtime/Provider_Operations.h"

namespace tvx::test {
namespace {

using No_Library = Provider_Test;

TEST_F(No_Library, EveryClassAnswersEmptyWithAGoodStatus) {
  load();
  for (const std::string& name : servedClasses()) EXPECT_TRUE(instances(name).empty()) << name;
}

/// Calls one provider's entry, as the bridge does.
std::int32_t call(const cimrt::Registration* entry, std::uint32_t operation, void* argument) {
  return entry->provider_proc(entry, operation, argument, nullptr, nullptr, nullptr, nullptr,
                              nullptr, nullptr, nullptr);
}

TEST_F(No_Library, EveryProviderRefusesItsLoad) {
  void* library = dlopen(TVX_PROVIDER_LIBRARY, RTLD_NOW | RTLD_LOCAL);
  ASSERT_NE(library, nullptr) << dlerror();
  using Module = const cimrt::Registration* (*)();
  const auto module = reinterpret_cast<Module>(dlsym(library, "cimrt_module"));
  ASSERT_NE(module, nullptr);
  std::size_t count = 0;
  for (const cimrt::Registration* entry = module(); entry; entry = entry->next) {
    void* provider = nullptr;
    ASSERT_EQ(call(entry, cimrt::OPERATION_CREATE_PROVIDER, &provider), 0);
    EXPECT_EQ(call(entry, cimrt::OPERATION_LOAD, provider), cimrt::LOAD_FAILED)
        << entry->provider_name;
    EXPECT_EQ(call(entry, cimrt::OPERATION_UNLOAD, provider), cimrt::UNLOAD_OK);
    call(entry, cimrt::OPERATION_DESTROY_PROVIDER, provider);
    count++;
  }
  EXPECT_EQ(count, 152u);
  EXPECT_EQ(dlclose(library), 0);
}

}  // namespace
}  // namespace tvx::test
