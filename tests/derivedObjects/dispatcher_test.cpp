// The three shapes of a class's entry, over a provider that writes down what it is asked.
#include "derivedObjects/Dispatcher.h"

#include <gtest/gtest.h>

#include <string>

#include "derivedObjects/Calls.h"
#include "generated/Methods.h"

namespace cimrt::test {
namespace {

/// What the last operation was given; shared, since the entry makes the provider.
struct Seen {
  int created = 0;
  int destroyed = 0;
  std::string operation;
  const Instance* first = nullptr;
  const Instance* second = nullptr;
  std::string texts;
  const Meta_Method* method = nullptr;
  Instance* to_deliver = nullptr;
  std::int32_t answer = 0;
};

Seen seen;

class Recording_Provider final : public Skeleton_Provider {
 public:
  explicit Recording_Provider(const Provider_Entry& entry) : Skeleton_Provider(entry) {
    ++seen.created;
  }
  ~Recording_Provider() override { ++seen.destroyed; }

  std::int32_t load() override { return note("load"); }
  std::int32_t unload() override { return note("unload"); }
  std::int32_t get_instance(const Instance* model, Instance*& out) override {
    out = seen.to_deliver;
    return note("get", model);
  }
  std::int32_t enum_instances(const Instance* model, const Instance_Handler& handler) override {
    deliver(handler);
    return note("enum", model);
  }
  std::int32_t create_instance(const Instance* instance) override {
    return note("create", instance);
  }
  std::int32_t delete_instance(const Instance* instance) override {
    return note("delete", instance);
  }
  std::int32_t modify_instance(const Instance* model, const Instance* instance) override {
    return note("modify", model, instance);
  }
  std::int32_t enum_associator_names(const Instance* source, const String& result_class,
                                     const String& role, const String& result_role,
                                     const Instance_Handler& handler) override {
    deliver(handler);
    seen.texts = joined(result_class, role, result_role);
    return note("associator names", source);
  }
  std::int32_t enum_references(const Instance* source, const Instance* model, const String& role,
                               const Instance_Handler& handler) override {
    deliver(handler);
    seen.texts = role.c_str();
    return note("references", source, model);
  }
  std::int32_t enum_associators(const Instance* source, const String& result_class,
                                const String& role, const String& result_role,
                                const Instance_Handler& handler) override {
    deliver(handler);
    seen.texts = joined(result_class, role, result_role);
    return note("associators", source);
  }
  std::int32_t invoke(const Meta_Method* method, Instance* instance, Instance* record) override {
    seen.method = method;
    return note("invoke", instance, record);
  }

 private:
  static std::int32_t note(const char* operation, const Instance* first = nullptr,
                           const Instance* second = nullptr) {
    seen.operation = operation;
    seen.first = first;
    seen.second = second;
    return seen.answer;
  }
  static void deliver(const Instance_Handler& handler) {
    if (seen.to_deliver) handler.handle(std::exchange(seen.to_deliver, nullptr));
  }
  static std::string joined(const String& a, const String& b, const String& c) {
    return std::string(a.c_str()) + "," + b.c_str() + "," + c.c_str();
  }
};

Skeleton_Provider* create_recording(const Provider_Entry& entry) {
  return new Recording_Provider(entry);
}

const Provider_Entry plain_entry{
    {"Module", "TVXHBA_Chip_Provider", plain_proc, &TVXHBA_Chip::static_meta_class, nullptr},
    create_recording,
    nullptr};
const Provider_Entry method_entry{
    {"Module", "TVXHBA_Card_Provider", method_proc, &TVXHBA_Card::static_meta_class, nullptr},
    create_recording,
    nullptr};
const Provider_Entry association_entry{{"Module", "TVXHBA_ControlledBy_Provider", association_proc,
                                        &TVXHBA_ControlledBy::static_meta_class, nullptr},
                                       create_recording,
                                       nullptr};
const Provider_Entry* const shapes[] = {&plain_entry, &method_entry, &association_entry};

class Dispatcher : public testing::Test {
 protected:
  void SetUp() override { seen = Seen(); }

  TVXHBA_Chip* chip() { return _chip.get(); }
  TVXHBA_Chip* other() { return _other.get(); }

 private:
  Ref<TVXHBA_Chip> _chip{TVXHBA_Chip::create()};
  Ref<TVXHBA_Chip> _other{TVXHBA_Chip::create()};
};

TEST_F(Dispatcher, AnswersTheClassAndItsRepositoryWithoutAProvider) {
  for (const Provider_Entry* entry : shapes) {
    const Meta_Class* meta_class = nullptr;
    const Meta_Repository* repository = nullptr;
    EXPECT_EQ(call(*entry, OPERATION_GET_META_CLASS, &meta_class), 0);
    EXPECT_EQ(call(*entry, OPERATION_GET_REPOSITORY, &repository), 0);
    EXPECT_EQ(meta_class, entry->meta_class);
    EXPECT_EQ(repository, &meta_repository);
  }
}

TEST_F(Dispatcher, MakesAndDestroysTheProvider) {
  for (const Provider_Entry* entry : shapes) {
    seen = Seen();
    void* provider = nullptr;
    EXPECT_EQ(call(*entry, OPERATION_CREATE_PROVIDER, &provider), 0);
    ASSERT_NE(provider, nullptr);
    EXPECT_EQ(seen.created, 1);
    EXPECT_EQ(call(*entry, OPERATION_DESTROY_PROVIDER, provider), 0);
    EXPECT_EQ(seen.destroyed, 1);
  }
}

TEST_F(Dispatcher, DestroyingNoProviderIsFine) {
  for (const Provider_Entry* entry : shapes) {
    EXPECT_EQ(call(*entry, OPERATION_DESTROY_PROVIDER, static_cast<void*>(nullptr)), 0);
  }
}

TEST_F(Dispatcher, RefusesToWorkWithoutAProviderOrAPlace) {
  for (const Provider_Entry* entry : shapes) {
    for (std::uint32_t operation = 0; operation <= OPERATION_ENUM_ASSOCIATORS; ++operation) {
      if (operation == OPERATION_DESTROY_PROVIDER) continue;
      EXPECT_EQ(call(*entry, operation), -1) << operation;
    }
  }
}

TEST_F(Dispatcher, HandsThePlainOperationsOnAndAnswersTheirStatus) {
  for (const Provider_Entry* entry : shapes) {
    const Made_Provider provider(*entry);
    const auto expect = [&](const char* operation, const Instance* first, const Instance* second) {
      EXPECT_EQ(seen.operation, operation);
      EXPECT_EQ(seen.first, first);
      EXPECT_EQ(seen.second, second);
    };
    seen.answer = 30;
    EXPECT_EQ(provider(OPERATION_LOAD), 30);
    expect("load", nullptr, nullptr);
    seen.answer = 0;
    EXPECT_EQ(provider(OPERATION_UNLOAD), 0);
    expect("unload", nullptr, nullptr);
    seen.answer = 80;
    EXPECT_EQ(provider(OPERATION_CREATE_INSTANCE, chip()), 80);
    expect("create", chip(), nullptr);
    seen.answer = 90;
    EXPECT_EQ(provider(OPERATION_DELETE_INSTANCE, chip()), 90);
    expect("delete", chip(), nullptr);
    seen.answer = 102;
    EXPECT_EQ(provider(OPERATION_MODIFY_INSTANCE, chip(), other()), 102);
    expect("modify", chip(), other());
  }
}

TEST_F(Dispatcher, PutsAFoundInstanceInItsPlace) {
  for (const Provider_Entry* entry : shapes) {
    const Made_Provider provider(*entry);
    seen.to_deliver = other();
    seen.answer = 0;
    Instance* out = nullptr;
    EXPECT_EQ(provider(OPERATION_GET_INSTANCE, chip(), &out), 0);
    EXPECT_EQ(out, other());
    EXPECT_EQ(seen.first, chip());
  }
}

TEST_F(Dispatcher, EndsAnEnumerationWithItsStatus) {
  for (const Provider_Entry* entry : shapes) {
    const Made_Provider provider(*entry);
    for (const std::int32_t status : {0, 70, 71}) {
      Deliveries deliveries;
      seen.to_deliver = TVXHBA_Chip::create();
      seen.answer = status;
      EXPECT_EQ(provider(OPERATION_ENUM_INSTANCES, chip(), &Deliveries::take, &deliveries), status);
      EXPECT_EQ(seen.first, chip());
      EXPECT_EQ(deliveries.instances, 1u);
      EXPECT_EQ(deliveries.ends, std::vector<std::int32_t>{status});
    }
  }
}

TEST_F(Dispatcher, AnswersMinusOneToIndicationsAndUnknownCodes) {
  for (const Provider_Entry* entry : shapes) {
    const Made_Provider provider(*entry);
    for (const std::uint32_t operation : {11u, 12u, 17u, 18u, 1000u, 0xFFFFFFFFu}) {
      EXPECT_EQ(provider(operation, chip(), chip()), -1) << operation;
    }
    EXPECT_EQ(seen.operation, "");
  }
}

TEST_F(Dispatcher, OnlyAnAssociationHasAssociationOperations) {
  for (const Provider_Entry* entry : {&plain_entry, &method_entry}) {
    const Made_Provider provider(*entry);
    for (std::uint32_t operation = 14; operation <= 16; ++operation) {
      EXPECT_EQ(provider(operation, chip()), -1) << operation;
    }
  }
  EXPECT_EQ(seen.operation, "");
}

TEST_F(Dispatcher, OnlyAClassWithMethodsInvokesThem) {
  const Ref<Instance> record(create(find_method(&TVXHBA_Card::static_meta_class, "IsCompatible")));
  EXPECT_EQ(Made_Provider(plain_entry)(OPERATION_INVOKE_METHOD, chip(), record.get()), -1);
  EXPECT_EQ(Made_Provider(association_entry)(OPERATION_INVOKE_METHOD, chip(), record.get()), -1);
  EXPECT_EQ(seen.operation, "");
}

TEST_F(Dispatcher, FindsTheMethodByTheNameOfTheRecord) {
  const Made_Provider provider(method_entry);
  for (const char* name : {"IsCompatible", "ConnectorPower"}) {
    const Meta_Method* method = find_method(&TVXHBA_Card::static_meta_class, name);
    const Ref<Instance> record(create(method));
    seen.answer = 131;
    EXPECT_EQ(provider(OPERATION_INVOKE_METHOD, chip(), record.get()), 131);
    EXPECT_EQ(seen.method, method);
    EXPECT_EQ(seen.first, chip());
    EXPECT_EQ(seen.second, record.get());
  }
}

TEST_F(Dispatcher, ComparesMethodNamesWithoutRegardToCase) {
  Meta_Method shouting{};
  const Meta_Method* method = find_method(&TVXHBA_Card::static_meta_class, "ConnectorPower");
  shouting.flags = method->flags;
  shouting.name = "CONNECTORPOWER";
  shouting.meta_features = method->meta_features;
  shouting.num_meta_features = method->num_meta_features;
  shouting.size = method->size;
  shouting.return_type = method->return_type;
  const Ref<Instance> record(create(&shouting));
  EXPECT_EQ(Made_Provider(method_entry)(OPERATION_INVOKE_METHOD, chip(), record.get()), 0);
  EXPECT_EQ(seen.method, method);
}

TEST_F(Dispatcher, AnswersMinusOneToAMethodOfAnotherClass) {
  const Ref<Instance> record(create(find_method(&TVXHBA_FCPort::static_meta_class, "Reset")));
  EXPECT_EQ(Made_Provider(method_entry)(OPERATION_INVOKE_METHOD, chip(), record.get()), -1);
  EXPECT_EQ(Made_Provider(method_entry)(OPERATION_INVOKE_METHOD, chip()), -1);
  EXPECT_EQ(seen.operation, "");
}

struct Association_Operation {
  std::uint32_t code;
  const char* name;
  std::int32_t unsupported;
};

constexpr Association_Operation association_operations[] = {
    {OPERATION_ENUM_ASSOCIATOR_NAMES, "associator names", 111},
    {OPERATION_ENUM_REFERENCES, "references", 121},
    {OPERATION_ENUM_ASSOCIATORS, "associators", 171},
};

class Association_Dispatcher : public Dispatcher {
 protected:
  std::int32_t run(std::uint32_t operation, Deliveries& deliveries) {
    const Made_Provider provider(association_entry);
    const String result_class("ResultClass"), role("Role"), result_role("ResultRole");
    if (operation == OPERATION_ENUM_REFERENCES) {
      return provider(operation, chip(), other(), &role, &Deliveries::take, &deliveries);
    }
    return provider(operation, chip(), &result_class, &role, &result_role, &Deliveries::take,
                    &deliveries);
  }
};

TEST_F(Association_Dispatcher, PassesUnsupportedOnWithoutAnEndCall) {
  for (const Association_Operation& operation : association_operations) {
    Deliveries deliveries;
    seen.answer = operation.unsupported;
    EXPECT_EQ(run(operation.code, deliveries), operation.unsupported);
    EXPECT_EQ(seen.operation, operation.name);
    EXPECT_TRUE(deliveries.ends.empty());
  }
}

TEST_F(Association_Dispatcher, EndsEveryOtherAnswerWithItsStatus) {
  for (const Association_Operation& operation : association_operations) {
    for (const std::int32_t status : {0, 110, 112, 120, 122, 170, 172}) {
      Deliveries deliveries;
      seen.to_deliver = TVXHBA_Chip::create();
      seen.answer = status;
      EXPECT_EQ(run(operation.code, deliveries), status);
      EXPECT_EQ(deliveries.instances, 1u);
      EXPECT_EQ(deliveries.ends, std::vector<std::int32_t>{status}) << operation.name;
    }
  }
}

TEST_F(Association_Dispatcher, HandsSourceModelAndFiltersOn) {
  Deliveries deliveries;
  run(OPERATION_ENUM_ASSOCIATOR_NAMES, deliveries);
  EXPECT_EQ(seen.first, chip());
  EXPECT_EQ(seen.texts, "ResultClass,Role,ResultRole");
  run(OPERATION_ENUM_REFERENCES, deliveries);
  EXPECT_EQ(seen.first, chip());
  EXPECT_EQ(seen.second, other());
  EXPECT_EQ(seen.texts, "Role");
  run(OPERATION_ENUM_ASSOCIATORS, deliveries);
  EXPECT_EQ(seen.texts, "ResultClass,Role,ResultRole");
}

}  // namespace
}  // namespace cimrt::test
