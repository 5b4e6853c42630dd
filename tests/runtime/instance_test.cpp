#include "runtime/Instance.h"

#include <gtest/gtest.h>

#include <cmath>
#include <cstdlib>
#include <new>
#include <string>
#include <vector>

#include "../logs/Failing_New.h"
#include "Test_Schema.h"

namespace cimrt {
namespace {

using namespace test;

/// True if every scalar and array property of an instance has this null flag.
bool all_flags_are(const Instance* instance, bool null, bool keys = true, bool non_keys = true) {
  const Meta_Record* record = instance->meta_class;
  for (std::uint64_t i = 0; i < record->num_meta_features; ++i) {
    const Meta_Feature* f = record->meta_features[i];
    if (!is_property(f) || ((f->flags & FLAG_KEY) != 0 ? !keys : !non_keys)) continue;
    if ((*null_flag(instance, f) != 0) != null) return false;
  }
  return true;
}

TEST(Instance, HeaderTakes24Bytes) {
  EXPECT_EQ(sizeof(Instance), 24u);
}

TEST(Instance, IsBornWithMagicOneReferenceAndNoNamespace) {
  const Ref<T_Device> device = make<T_Device>();
  EXPECT_EQ(device->magic, 0xF00DFACEu);
  EXPECT_EQ(device->refs.load(), 1u);
  EXPECT_EQ(device->meta_class, &T_Device::static_meta_class);
  EXPECT_TRUE(device->__name_space.empty());
}

TEST(Instance, WithDefaultsEveryPropertyWithoutADefaultIsNull) {
  const Ref<T_Device> device = make<T_Device>(true);
  EXPECT_TRUE(all_flags_are(device.get(), true));
  EXPECT_FALSE(keys_non_null(device.get()));
}

TEST(Instance, WithDefaultsTheDefaultsAreApplied) {
  const Ref<T_All> all = make<T_All>(true);
  EXPECT_STREQ(all->Id.value.c_str(), "all");
  EXPECT_FALSE(all->Id.is_null());
  EXPECT_EQ(all->Uint16.value, 7);
  EXPECT_FALSE(all->Uint16.is_null());
  EXPECT_EQ(all->When.value.usec(), 93784000005u);
  EXPECT_TRUE(all->Uint16s.value.equal(Array<std::uint16_t>{1, 2, 3}));
  EXPECT_TRUE(all->Texts.value.equal(Array<String>{"a", "b"}));
  ASSERT_EQ(all->Whens.value.size(), 1u);
  EXPECT_EQ(all->Whens.value[0].usec(), 93784000005u);
  EXPECT_FALSE(all->Whens.is_null());
  EXPECT_TRUE(all->Uint32.is_null());
  EXPECT_TRUE(all->Texts.value.size() == 2 && all->Uint32s.is_null());
}

TEST(Instance, WithoutDefaultsNothingIsNullAndEverythingIsZero) {
  const Ref<T_All> all = make<T_All>(false);
  EXPECT_TRUE(all_flags_are(all.get(), false));
  EXPECT_TRUE(all->Id.value.empty());
  EXPECT_EQ(all->Uint16.value, 0);
  EXPECT_TRUE(all->When.value.equal(Datetime()));
  EXPECT_EQ(all->Uint16s.value.size(), 0u);
  EXPECT_TRUE(keys_non_null(all.get()));
}

TEST(Instance, ReferencesStartNullAndReferenceArraysEmpty) {
  const Ref<T_Group> group = make<T_Group>();
  EXPECT_EQ(group->Leader, nullptr);
  EXPECT_EQ(group->Members.value.size(), 0u);
}

TEST(Instance, AMethodRecordCarriesNullParameters) {
  const Ref<T_Device_Reset> call(
      static_cast<T_Device_Reset*>(create(&T_Device_Reset::static_meta_method)));
  EXPECT_EQ(class_of(call.get()), nullptr);
  EXPECT_TRUE(all_flags_are(call.get(), true));
  EXPECT_EQ(call->Target, nullptr);
  call->Answer.set("text");
  call->return_value.set(4u);
  const Ref<T_Device_Reset> copy(clone(call.get()));
  EXPECT_STREQ(copy->Answer.value.c_str(), "text");
  EXPECT_EQ(copy->return_value.value, 4u);
  const Ref<Instance> keys(key_clone(call.get()));
  EXPECT_TRUE(all_flags_are(keys.get(), true));
}

TEST(Instance, CloneIsDeepButForSharedTexts) {
  Ref<T_All> all = make<T_All>();
  all->__name_space.assign("root/torvex");
  all->Text.set("some text");
  all->Texts.append("c");
  ref(all.get());
  const Ref<T_All> copy(clone(all.get()));
  EXPECT_EQ(copy->refs.load(), 1u);
  EXPECT_EQ(copy->magic, INSTANCE_MAGIC);
  EXPECT_STREQ(copy->__name_space.c_str(), "root/torvex");
  EXPECT_TRUE(identical(all.get(), copy.get()));
  EXPECT_EQ(copy->Text.value.rep(), all->Text.value.rep());
  all->Texts.value[0].assign("changed");
  all->Text.value.append('!');
  EXPECT_STREQ(copy->Texts.value[0].c_str(), "a");
  EXPECT_STREQ(copy->Text.value.c_str(), "some text");
  unref(all.get());
}

TEST(Instance, CloneCopiesTargetsAndKeepsNulls) {
  Ref<T_Group> group = make<T_Group>();
  group->Leader = make_device("leader", 1).release();
  group->Members.append(make_device("first", 2).release());
  group->Members.append(nullptr);
  const Ref<T_Group> copy(clone(group.get()));
  ASSERT_NE(copy->Leader, nullptr);
  EXPECT_NE(copy->Leader, group->Leader);
  EXPECT_STREQ(copy->Leader->Name.value.c_str(), "leader");
  EXPECT_EQ(copy->Embedded, nullptr);
  ASSERT_EQ(copy->Members.value.size(), 2u);
  EXPECT_NE(copy->Members.value[0], group->Members.value[0]);
  EXPECT_EQ(copy->Members.value[1], nullptr);
}

TEST(Instance, DestroyReleasesWhatItOwns) {
  const String text("counted text");
  Ref<T_Device> device = make_device("leader", 1);
  T_Device* leader = device.get();
  {
    Ref<T_Group> group = make<T_Group>();
    group->Id.set(text);
    group->Leader = leader;
    ref(leader);
    group->Members.append(leader);
    ref(leader);
    EXPECT_EQ(leader->refs.load(), 3u);
    EXPECT_EQ(text.rep()->refs.load(), 2u);
  }
  EXPECT_EQ(leader->refs.load(), 1u);
  EXPECT_EQ(text.rep()->refs.load(), 1u);
}

TEST(Instance, UnrefOfNullDoesNothing) {
  Instance* const nothing = nullptr;
  EXPECT_EXIT(
      {
        unref(nothing);
        ref(nothing);
        destroy(nothing);
        std::_Exit(7);  // reached only if none of them touched the null pointer
      },
      testing::ExitedWithCode(7), "");
}

TEST(Instance, RefCountsCopies) {
  Ref<T_Device> a = make<T_Device>();
  {
    const Ref<T_Device> b(a);
    Ref<T_Device> c;
    c = b;
    EXPECT_EQ(a->refs.load(), 3u);
    const Ref<T_Device> d(std::move(c));
    EXPECT_EQ(a->refs.load(), 3u);
  }
  EXPECT_EQ(a->refs.load(), 1u);
  T_Device* released = a.release();
  EXPECT_FALSE(a);
  unref(released);
}

TEST(Instance, SetReferenceReleasesTheOldTarget) {
  Ref<T_Device> old_target = make<T_Device>();
  Ref<T_Group> group = make<T_Group>();
  ref(old_target.get());
  group->Leader = old_target.get();
  set_reference(group->Leader, make_device("new", 1).release());
  EXPECT_EQ(old_target->refs.load(), 1u);
  EXPECT_STREQ(group->Leader->Name.value.c_str(), "new");
}

TEST(Instance, NullifyPropertiesPicksKeysAndNonKeys) {
  const Ref<T_Device> device = make<T_Device>(false);
  nullify_properties(device.get(), true, false, true);
  EXPECT_TRUE(all_flags_are(device.get(), true, true, false));
  EXPECT_TRUE(all_flags_are(device.get(), false, false, true));
  nullify_properties(device.get(), true, true, false);
  EXPECT_TRUE(all_flags_are(device.get(), false));
  nullify_non_keys(device.get());
  EXPECT_TRUE(all_flags_are(device.get(), false, true, false));
  EXPECT_TRUE(all_flags_are(device.get(), true, false, true));
}

TEST(FilterProperties, OfNullMakesEverythingNonNull) {
  const Ref<T_Device> device = make<T_Device>(true);
  EXPECT_EQ(filter_properties(device.get(), nullptr, false), 0);
  EXPECT_TRUE(all_flags_are(device.get(), false));
}

TEST(FilterProperties, OfAnEmptyListLeavesEverythingNull) {
  const Ref<T_Device> device = make<T_Device>(false);
  const char* const none[] = {nullptr};
  EXPECT_EQ(filter_properties(device.get(), none, false), 0);
  EXPECT_TRUE(all_flags_are(device.get(), true));
}

TEST(FilterProperties, KeepsKeysWhenTold) {
  const Ref<T_Device> device = make<T_Device>(false);
  const char* const names[] = {"SPEED", "Unknown", nullptr};
  EXPECT_EQ(filter_properties(device.get(), names, true), 0);
  EXPECT_FALSE(device->Name.is_null());
  EXPECT_TRUE(device->Caption.is_null());
  EXPECT_FALSE(device->Speed.is_null());
}

TEST(FilterProperties, OfAKeyNameLeavesTheKeyNull) {
  const Ref<T_Device> device = make<T_Device>(false);
  const char* const names[] = {"Name", "Caption", nullptr};
  EXPECT_EQ(filter_properties(device.get(), names, false), 0);
  EXPECT_TRUE(device->Name.is_null());
  EXPECT_FALSE(device->Caption.is_null());
}

TEST(FilterProperties, OfAReferenceMakesAnEmptySubInstance) {
  const Ref<T_Group> group = make<T_Group>();
  group->Members.null = 1;
  const char* const names[] = {"Leader", "Members", nullptr};
  EXPECT_EQ(filter_properties(group.get(), names, true), 0);
  ASSERT_NE(group->Leader, nullptr);
  EXPECT_EQ(group->Leader->meta_class, &T_Device::static_meta_class);
  EXPECT_EQ(group->Embedded, nullptr);
  EXPECT_EQ(group->Members.null, 0);
  T_Device* leader = group->Leader;
  EXPECT_EQ(filter_properties(group.get(), names, true), 0);
  EXPECT_EQ(group->Leader, leader);
}

TEST(FilterProperties, OfAMethodStopsThereWithTheEarlierNamesApplied) {
  const Ref<T_Device> device = make<T_Device>(false);
  const char* const names[] = {"Caption", "Reset", "Speed", nullptr};
  EXPECT_EQ(filter_properties(device.get(), names, true), -1);
  EXPECT_FALSE(device->Caption.is_null());
  EXPECT_TRUE(device->Speed.is_null());
}

TEST(Copy, RefusesAnotherClassSilently) {
  const Ref<T_Device> device = make_device("a", 1);
  const Ref<T_Port> port = make_device<T_Port>("b", 2);
  copy(device.get(), port.get());
  copy_keys(device.get(), port.get());
  EXPECT_STREQ(device->Name.value.c_str(), "a");
  const Ref<T_Device> other = make_device("c", 3);
  copy(device.get(), other.get(), port.get());
  EXPECT_STREQ(device->Name.value.c_str(), "a");
}

TEST(Copy, TakesValuesAndNullFlags) {
  Ref<T_All> source = make<T_All>();
  source->Uint64.set(5u);
  source->Texts.set({"x"});
  source->When.set(Datetime(9));
  const Ref<T_All> dest = make<T_All>(false);
  copy(dest.get(), source.get());
  EXPECT_TRUE(identical(dest.get(), source.get()));
  source->Texts.value[0].assign("y");
  EXPECT_STREQ(dest->Texts.value[0].c_str(), "x");
}

TEST(Copy, WithAModelTakesOnlyWhatIsNonNullThere) {
  const Ref<T_Group> source = make<T_Group>();
  source->Id.set("source");
  source->Leader = make_device("leader", 1).release();
  source->Embedded = make_device("embedded", 2).release();
  source->Members.append(make_device("member", 3).release());
  const Ref<T_Group> dest = make<T_Group>();
  dest->Id.set("dest");
  const Ref<T_Group> model = make<T_Group>();
  model->Embedded = make<T_Device>().release();
  model->Members.null = 1;
  copy(dest.get(), source.get(), model.get());
  EXPECT_STREQ(dest->Id.value.c_str(), "dest");
  EXPECT_EQ(dest->Leader, nullptr);
  EXPECT_EQ(dest->Members.value.size(), 0u);
  ASSERT_NE(dest->Embedded, nullptr);
  EXPECT_NE(dest->Embedded, source->Embedded);
  model->Members.null = 0;
  model->Id.set("");
  copy(dest.get(), source.get(), model.get());
  copy(dest.get(), source.get(), model.get());
  EXPECT_STREQ(dest->Id.value.c_str(), "source");
  ASSERT_EQ(dest->Members.value.size(), 1u);
  EXPECT_TRUE(identical(dest->Members.value[0], source->Members.value[0]));
}

/// A group of two members.
Ref<T_Group> two_members() {
  Ref<T_Group> group = make<T_Group>();
  group->Members.append(make_device("first", 1).release());
  group->Members.append(make_device("second", 2).release());
  return group;
}

TEST(Copy, WithoutMemoryForAMemberLeavesTheMembersThatWereThere) {
  const Ref<T_Group> source = two_members();
  const Ref<T_Group> dest = make<T_Group>();
  dest->Members.append(make_device("own", 3).release());
  for (const int spare : {0, 1}) {
    const Failing_New no_memory(sizeof(T_Device), spare);
    EXPECT_THROW(copy(dest.get(), source.get()), std::bad_alloc);
  }
  ASSERT_EQ(dest->Members.value.size(), 1u);
  EXPECT_TRUE(identical(dest->Members.value[0], make_device("own", 3).get()));
  copy(dest.get(), source.get());
  EXPECT_EQ(dest->Members.value.size(), 2u);
}

TEST(Clone, WithoutMemoryForAMemberIsNotMade) {
  const Ref<T_Group> source = two_members();
  for (const int spare : {0, 1}) {
    const Failing_New no_memory(sizeof(T_Device), spare);
    EXPECT_THROW(clone(source.get()), std::bad_alloc);
  }
  EXPECT_EQ(source->Members.value[0]->refs.load(), 1u);
  const Ref<T_Group> copy(clone(source.get()));
  EXPECT_EQ(copy->Members.value.size(), 2u);
}

TEST(Copy, OfAnInstanceOntoItselfChangesNothing) {
  const Ref<T_Group> group = make<T_Group>();
  group->Id.set("id");
  group->Leader = make_device("leader", 1).release();
  group->Members.append(make_device("member", 3).release());
  const Ref<T_Group> before(clone(group.get()));
  copy(group.get(), group.get());
  EXPECT_TRUE(identical(group.get(), before.get()));
}

TEST(Copy, OfKeysTakesNothingElse) {
  const Ref<T_Device> source = make_device("a", 1);
  source->Caption.set("caption");
  const Ref<T_Device> dest = make<T_Device>();
  copy_keys(dest.get(), source.get());
  EXPECT_TRUE(key_eq(dest.get(), source.get()));
  EXPECT_TRUE(dest->Caption.is_null());
}

TEST(KeyClone, HasTheKeysAndNothingElse) {
  const Ref<T_Link> link = make_link(make_device("a", 1), make_device("b", 2));
  link->Weight.set(std::uint16_t{5});
  const Ref<T_Link> keys(static_cast<T_Link*>(key_clone(link.get())));
  EXPECT_TRUE(key_eq(keys.get(), link.get()));
  EXPECT_NE(keys->Antecedent, link->Antecedent);
  EXPECT_TRUE(keys->Weight.is_null());
  EXPECT_EQ(keys->Weight.value, 0);
}

TEST(Clear, ResetsEveryFieldAndTheNamespace) {
  const Ref<T_All> all = make<T_All>();
  all->__name_space.assign("root/torvex");
  all->Uint32.set(9u);
  clear(all.get());
  EXPECT_TRUE(all->__name_space.empty());
  EXPECT_TRUE(all_flags_are(all.get(), true));
  EXPECT_TRUE(all->Id.value.empty());
  EXPECT_EQ(all->Uint32.value, 0u);
  EXPECT_EQ(all->Texts.value.size(), 0u);
  EXPECT_TRUE(all->When.value.equal(Datetime()));
  const Ref<T_Group> group = make<T_Group>();
  const Ref<T_Device> member = make<T_Device>();
  ref(member.get());
  ref(member.get());
  group->Members.append(member.get());
  group->Leader = member.get();
  clear(group.get());
  EXPECT_EQ(member->refs.load(), 1u);
  EXPECT_EQ(group->Leader, nullptr);
  EXPECT_EQ(group->Members.value.size(), 0u);
  EXPECT_NE(group->Members.null, 0);
}

}  // namespace
}  // namespace cimrt
