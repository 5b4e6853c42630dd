// The library that a CIM server loads: what it exports, what it needs, and its list of classes.
#include <dlfcn.h>
#include <gtest/gtest.h>

#include <cstdio>
#include <memory>
#include <set>
#include <sstream>
#include <string>

#include "cmpi/cmpidt.h"
#include "cmpi/cmpift.h"
#include "runtime/Provider_Operations.h"
#include "schema/catalogue.h"

namespace cimrt::test {
namespace {

using Lines = std::set<std::string>;

/// Output of a command, line by line.
Lines output_of(const std::string& command) {
  const std::unique_ptr<std::FILE, int (*)(std::FILE*)> pipe(popen(command.c_str(), "r"), pclose);
  Lines lines;
  if (!pipe) return lines;
  char buffer[1024];
  while (std::fgets(buffer, sizeof buffer, pipe.get())) {
    std::string line = buffer;
    while (!line.empty() && line.back() == '\n') line.pop_back();
    lines.insert(line);
  }
  return lines;
}

Lines exported_symbols() {
  Lines names;
  for (const std::string& line : output_of("nm -D --defined-only --format=posix " TVX_MODULE)) {
    names.insert(line.substr(0, line.find(' ')));
  }
  return names;
}

TEST(Module, ExportsTheFactoriesAndTheListOfClassesAndNothingElse) {
  Lines expected = {"cimrt_module"};
  for (const Catalogue_Row& row : catalogue) {
    for (const char* form : {"_Provider_Create_", "_Create_"}) {
      expected.insert(row.name + std::string(form) + "InstanceMI");
      expected.insert(row.name + std::string(form) + "MethodMI");
      if (row.is_association()) expected.insert(row.name + std::string(form) + "AssociationMI");
    }
  }
  EXPECT_EQ(expected.size(), 809u);
  EXPECT_EQ(exported_symbols(), expected);
}

TEST(Module, NeedsOnlyTheSystemsOwnLibraries) {
  const Lines allowed = {"libc.so.6", "libstdc++.so.6", "libgcc_s.so.1", "libm.so.6",
                         "libpthread.so.0", "libdl.so.2", "ld-linux-x86-64.so.2",
                         // What a build under a sanitizer adds.
                         "libasan.so.8", "libubsan.so.1", "libtsan.so.2"};
  Lines needed;
  for (const std::string& line : output_of("readelf -d " TVX_MODULE)) {
    const auto open = line.find('['), close = line.find(']');
    if (line.find("(NEEDED)") == std::string::npos) continue;
    needed.insert(line.substr(open + 1, close - open - 1));
  }
  EXPECT_TRUE(needed.contains("libc.so.6"));
  for (const std::string& library : needed) {
    EXPECT_TRUE(allowed.contains(library)) << library;
  }
}

/// The opened library; closed at the end of the test.
class Opened_Module : public testing::Test {
 protected:
  void SetUp() override {
    _handle = dlopen(TVX_MODULE, RTLD_NOW | RTLD_LOCAL);
    ASSERT_NE(_handle, nullptr) << dlerror();
  }
  void TearDown() override {
    if (_handle) dlclose(_handle);
  }
  template <class F>
  F* symbol(const std::string& name) {
    return reinterpret_cast<F*>(dlsym(_handle, name.c_str()));
  }

 private:
  void* _handle = nullptr;
};

TEST_F(Opened_Module, AnswersTheHeadOfTheListOfItsClasses) {
  auto* const module = symbol<const Registration*()>("cimrt_module");
  ASSERT_NE(module, nullptr);
  const Registration* record = module();
  for (std::size_t i = std::size(catalogue); i-- > 0; record = record->next) {
    ASSERT_NE(record, nullptr);
    EXPECT_EQ(record->provider_name, std::string(catalogue[i].name) + "_Provider");
    EXPECT_STREQ(record->module_name, "torvex_fc_provider_Module");
  }
  EXPECT_EQ(record, nullptr);
}

}  // namespace
}  // namespace cimrt::test
