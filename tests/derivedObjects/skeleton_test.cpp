// What every provider class answers on a machine without the management libraries, and the list of
// registrations.
#include <gtest/gtest.h>

#include <algorithm>
#include <mutex>
#include <set>
#include <string>

#include "agent/ProviderAgent.h"
#include "common/CLogger.h"
#include "derivedObjects/Calls.h"
#include "derivedObjects/Dispatcher.h"
#include "derivedObjects/Skeleton_Provider.h"
#include "schema/catalogue.h"
#include "support/Temp_Root.h"

namespace cimrt::test {
namespace {

struct Logged {
  int level;
  std::string file;
  std::string text;
  auto operator<=>(const Logged&) const = default;
};

class Log_Record final : public TVX_LoggerInterface {
 public:
  Log_Record() { getLogger().registerInterface(this); }
  ~Log_Record() override { getLogger().unregisterInterface(this); }

  void log(int level, const char* file, const unsigned*, const char* text) override {
    const std::lock_guard lock(_mutex);
    _messages.insert({level, file, text});
  }
  void open() override {}
  void close() override {}
  void clear() override {}

  std::size_t count(const Logged& message) const {
    const std::lock_guard lock(_mutex);
    return _messages.count(message);
  }

 private:
  mutable std::mutex _mutex;
  std::multiset<Logged> _messages;
};

/// No adapter library can be opened: none lies in the program's search path.
class Skeleton : public testing::Test {
 protected:
  Skeleton() { getLogger().enable(); }

 private:
  tvx::test::Temp_Root _root;
};

const Provider_Entry& entry_named(const std::string& name) {
  const auto* entry = std::ranges::find_if(provider_entries, [&](const Provider_Entry& e) {
    return e.provider_name == name + "_Provider";
  });
  EXPECT_NE(entry, std::end(provider_entries)) << name;
  return *entry;
}

TEST(Registrations, AreOneListInTheOrderOfTheCatalogue) {
  const Registration* record = &provider_entries[std::size(catalogue) - 1];
  for (std::size_t i = std::size(catalogue); i-- > 0; record = record->next) {
    ASSERT_NE(record, nullptr);
    EXPECT_STREQ(record->module_name, "torvex_fc_provider_Module");
    EXPECT_EQ(record->provider_name, std::string(catalogue[i].name) + "_Provider");
    EXPECT_STREQ(record->meta_class->name, catalogue[i].name);
  }
  EXPECT_EQ(record, nullptr);
}

TEST(Registrations, HaveTheEntryOfTheirShape) {
  for (const Catalogue_Row& row : catalogue) {
    const Provider_Proc expected = row.is_association() ? association_proc
                                   : row.methods > 0    ? method_proc
                                                        : plain_proc;
    EXPECT_EQ(entry_named(row.name).provider_proc, expected) << row.name;
  }
}

TEST(Registrations, OnlyRecordsOfLogsAndReferencesOfProfilesHaveNoMap) {
  std::set<std::string> without;
  for (const Provider_Entry& entry : provider_entries) {
    if (!entry.enumerate) without.insert(entry.meta_class->name);
  }
  const std::set<std::string> expected = {
      "TVXHBA_BaseServerReferencedProfile", "TVXHBA_ReferencedProfile", "TVXHBA_LogEntry",
      "TVXHBA_RecordLogManagesRecord", "TVXHBA_DriverRecordLogManagesRecord"};
  EXPECT_EQ(without, expected);
}

TEST_F(Skeleton, RefusesToLoadAndTakesNoReference) {
  const Made_Provider provider(entry_named("TVXHBA_VPortHostedDependency"));
  EXPECT_EQ(provider(OPERATION_LOAD), LOAD_FAILED);
  EXPECT_EQ(ProviderAgent::refCount(), 0u);
}

TEST_F(Skeleton, SupportsNothingButReading) {
  const Made_Provider provider(entry_named("TVXHBA_VPortHostedDependency"));
  const Ref<TVXHBA_VPortHostedDependency> model(TVXHBA_VPortHostedDependency::create());
  const String text;
  Instance* out = nullptr;
  Deliveries none;
  EXPECT_EQ(provider(OPERATION_GET_INSTANCE, model.get(), &out), 61);
  EXPECT_EQ(out, nullptr);
  EXPECT_EQ(provider(OPERATION_CREATE_INSTANCE, model.get()), 81);
  EXPECT_EQ(provider(OPERATION_DELETE_INSTANCE, model.get()), 91);
  EXPECT_EQ(provider(OPERATION_MODIFY_INSTANCE, model.get(), model.get()), 101);
  EXPECT_EQ(provider(OPERATION_ENUM_ASSOCIATOR_NAMES, model.get(), &text, &text, &text,
                     &Deliveries::take, &none),
            111);
  EXPECT_EQ(provider(OPERATION_ENUM_REFERENCES, model.get(), model.get(), &text, &Deliveries::take,
                     &none),
            121);
  EXPECT_EQ(provider(OPERATION_ENUM_ASSOCIATORS, model.get(), &text, &text, &text,
                     &Deliveries::take, &none),
            171);
  EXPECT_TRUE(none.ends.empty());
}

TEST_F(Skeleton, SupportsNoneOfItsMethods) {
  for (const char* name : {"TVXHBA_Card", "TVXHBA_ConcreteJob", "TVXHBA_PortController",
                           "TVXHBA_TapeDrive", "TVXHBA_PCIDevice", "TVXHBA_VirtualFCPort"}) {
    const Provider_Entry& entry = entry_named(name);
    const Made_Provider provider(entry);
    const Ref<Instance> model(create(entry.meta_class, false));
    for (std::uint64_t i = 0; i < entry.meta_class->num_meta_features; ++i) {
      const Meta_Feature* feature = entry.meta_class->meta_features[i];
      if (!is_method(feature)) continue;
      const Ref<Instance> record(create(as_method(feature)));
      EXPECT_EQ(provider(OPERATION_INVOKE_METHOD, model.get(), record.get()), 131)
          << name << "." << feature->name;
    }
  }
}

TEST_F(Skeleton, LogsItsUnloadAndItsEnumerationsUnderItsOwnName) {
  const Made_Provider provider(entry_named("TVXHBA_VPortHostedDependency"));
  const Ref<TVXHBA_VPortHostedDependency> model(TVXHBA_VPortHostedDependency::create());
  ProviderAgent::getInstance();  // made before the record, so that it does not switch logging off
  getLogger().enable();
  const Log_Record record;
  Deliveries deliveries;
  EXPECT_EQ(provider(OPERATION_ENUM_INSTANCES, model.get(), &Deliveries::take, &deliveries), 0);
  const std::string file = "derivedObjects/TVXHBA_VPortHostedDependency_Provider";
  EXPECT_EQ(record.count({5, file, "TVXHBA_VPortHostedDependency_Provider::enum_instances()"}), 1u);
  EXPECT_EQ(provider(OPERATION_UNLOAD), 0);
  EXPECT_EQ(record.count({5, file, "TVXHBA_VPortHostedDependency_Provider::unload()"}), 1u);
}

TEST_F(Skeleton, EveryClassEnumeratesEmptyWithStatusZero) {
  for (const Provider_Entry& entry : provider_entries) {
    SCOPED_TRACE(entry.provider_name);
    const Made_Provider provider(entry);
    const Ref<Instance> model(create(entry.meta_class, false));
    Deliveries deliveries;
    EXPECT_EQ(provider(OPERATION_ENUM_INSTANCES, model.get(), &Deliveries::take, &deliveries), 0);
    EXPECT_EQ(deliveries.instances, 0u);
    EXPECT_EQ(deliveries.ends, std::vector<std::int32_t>{0});
  }
}

}  // namespace
}  // namespace cimrt::test
