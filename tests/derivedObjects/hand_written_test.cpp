// A hand-written provider in the place of the skeleton: typed arguments, and nothing of another
// class.
#include <gtest/gtest.h>

#include <string>

#include "derivedObjects/Calls.h"
#include "derivedObjects/Dispatcher.h"
#include "derivedObjects/Hand_Written_Provider.h"

namespace cimrt::test {
namespace {

int calls = 0;

class TVXHBA_FCTagService_Provider {
 public:
  std::int32_t get_instance(const TVXHBA_FCTagService* model, TVXHBA_FCTagService*& out) {
    ++calls;
    out = clone(model);
    return GET_INSTANCE_OK;
  }
  std::int32_t create_instance(const TVXHBA_FCTagService*) {
    ++calls;
    return CREATE_INSTANCE_DUPLICATE;
  }
  std::int32_t modify_instance(const TVXHBA_FCTagService*, const TVXHBA_FCTagService*) {
    ++calls;
    return MODIFY_INSTANCE_OK;
  }
  std::int32_t GetGlobalFlag(const TVXHBA_FCTagService* service, const TVXHBA_FCPort* target,
                             Property<std::uint32_t>& state,
                             Property<std::uint32_t>& return_value) {
    ++calls;
    state.set(state.value + 1);
    return_value.set(target && std::string(service->Name.value.c_str()) == "tag" ? 0u : 4097u);
    return INVOKE_METHOD_OK;
  }
};

class TVXHBA_ControlledBy_Provider {
 public:
  std::int32_t enum_references(const Instance*, const TVXHBA_ControlledBy* model, const String&,
                               const Instance_Handler&) {
    calls += model ? 1 : 100;
    return ENUM_REFERENCES_OK;
  }
};

const Provider_Entry service_entry{
    {"Module", "TVXHBA_FCTagService_Provider", method_proc, &TVXHBA_FCTagService::static_meta_class,
     nullptr},
    create_hand_written<TVXHBA_FCTagService_Provider, TVXHBA_FCTagService>,
    nullptr};
const Provider_Entry association_entry{
    {"Module", "TVXHBA_ControlledBy_Provider", association_proc,
     &TVXHBA_ControlledBy::static_meta_class, nullptr},
    create_hand_written<TVXHBA_ControlledBy_Provider, TVXHBA_ControlledBy>,
    nullptr};

class Hand_Written : public testing::Test {
 protected:
  void SetUp() override {
    calls = 0;
    service->Name.set("tag");
  }

  Ref<TVXHBA_FCTagService> service{TVXHBA_FCTagService::create()};
  Ref<TVXHBA_Card> card{TVXHBA_Card::create()};
  Made_Provider provider{service_entry};
};

Ref<Instance> record_of(const Meta_Class& meta_class, const char* method) {
  return Ref<Instance>(create(find_method(&meta_class, method)));
}

TEST_F(Hand_Written, GetsItsOwnRecordsAndAnswersWithThem) {
  Instance* out = nullptr;
  EXPECT_EQ(provider(OPERATION_GET_INSTANCE, service.get(), &out), 0);
  const Ref<Instance> found(out);
  ASSERT_TRUE(found);
  EXPECT_TRUE(key_eq(found.get(), service.get()));
  EXPECT_EQ(provider(OPERATION_CREATE_INSTANCE, service.get()), 80);
  EXPECT_EQ(provider(OPERATION_MODIFY_INSTANCE, service.get(), service.get()), 0);
  EXPECT_EQ(calls, 3);
}

TEST_F(Hand_Written, LeavesWhatItDoesNotDeclareToTheSkeleton) {
  EXPECT_EQ(provider(OPERATION_DELETE_INSTANCE, service.get()), DELETE_INSTANCE_UNSUPPORTED);
  const Ref<Instance> record = record_of(TVXHBA_FCTagService::static_meta_class, "StartService");
  EXPECT_EQ(provider(OPERATION_INVOKE_METHOD, service.get(), record.get()),
            INVOKE_METHOD_UNSUPPORTED);
  EXPECT_EQ(calls, 0);
}

TEST_F(Hand_Written, MethodsGetTheFieldsOfTheRecord) {
  const Ref<Instance> record = record_of(TVXHBA_FCTagService::static_meta_class, "GetGlobalFlag");
  auto* fields = static_cast<TVXHBA_FCTagService_GetGlobalFlag*>(record.get());
  fields->Target = TVXHBA_FCPort::create();
  fields->State.set(6);
  EXPECT_EQ(provider(OPERATION_INVOKE_METHOD, service.get(), record.get()), 0);
  EXPECT_EQ(calls, 1);
  EXPECT_EQ(fields->State.value, 7u);
  EXPECT_FALSE(fields->return_value.is_null());
  EXPECT_EQ(fields->return_value.value, 0u);
}

TEST_F(Hand_Written, NeverSeesAnInstanceOfAnotherClass) {
  Instance* out = nullptr;
  EXPECT_EQ(provider(OPERATION_GET_INSTANCE, card.get(), &out), GET_INSTANCE_NOT_FOUND);
  EXPECT_EQ(out, nullptr);
  EXPECT_EQ(provider(OPERATION_CREATE_INSTANCE, card.get()), CREATE_INSTANCE_INVALID_PARAMETER);
  EXPECT_EQ(provider(OPERATION_MODIFY_INSTANCE, card.get(), service.get()),
            MODIFY_INSTANCE_INVALID_PARAMETER);
  EXPECT_EQ(provider(OPERATION_MODIFY_INSTANCE, service.get(), card.get()),
            MODIFY_INSTANCE_INVALID_PARAMETER);
  const Ref<Instance> record = record_of(TVXHBA_FCTagService::static_meta_class, "GetGlobalFlag");
  EXPECT_EQ(provider(OPERATION_INVOKE_METHOD, card.get(), record.get()), INVOKE_METHOD_UNSUPPORTED);
  EXPECT_EQ(calls, 0);
}

TEST_F(Hand_Written, NeverSeesTheRecordOfAnotherClassesMethod) {
  const Ref<Instance> record =
      record_of(TVXHBA_ConcreteJob::static_meta_class, "RequestStateChange");
  EXPECT_EQ(provider(OPERATION_INVOKE_METHOD, service.get(), record.get()),
            INVOKE_METHOD_UNSUPPORTED);
}

TEST_F(Hand_Written, AnAssociationGetsItsModelOnlyIfItIsOne) {
  const Made_Provider association(association_entry);
  const Ref<TVXHBA_ControlledBy> model(TVXHBA_ControlledBy::create());
  const String role;
  Deliveries deliveries;
  EXPECT_EQ(association(OPERATION_ENUM_REFERENCES, card.get(), model.get(), &role,
                        &Deliveries::take, &deliveries),
            0);
  EXPECT_EQ(calls, 1);
  association(OPERATION_ENUM_REFERENCES, card.get(), card.get(), &role, &Deliveries::take,
              &deliveries);
  EXPECT_EQ(calls, 101);
  EXPECT_EQ(deliveries.ends, (std::vector<std::int32_t>{0, 0}));
}

TEST(Typed_Instance, IsGivenForTheClassAndItsSubclassesOnly) {
  const Ref<TVXHBA_Card> card(TVXHBA_Card::create());
  EXPECT_EQ(typed<CIM_PhysicalElement>(card.get()), static_cast<Instance*>(card.get()));
  EXPECT_EQ(typed<TVXHBA_Card>(card.get()), card.get());
  EXPECT_EQ(typed<TVXHBA_FCPort>(card.get()), nullptr);
  EXPECT_EQ(typed<TVXHBA_FCPort>(static_cast<Instance*>(nullptr)), nullptr);
  const Ref<Instance> record(create(find_method(&TVXHBA_Card::static_meta_class, "IsCompatible")));
  EXPECT_EQ(typed<TVXHBA_Card>(record.get()), nullptr);
}

}  // namespace
}  // namespace cimrt::test
