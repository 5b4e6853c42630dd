#include "runtime/Instance_Map.h"

#include <gtest/gtest.h>

#include <functional>
#include <random>
#include <stdexcept>
#include <string>
#include <vector>

#include "Test_Schema.h"

namespace cimrt {
namespace {

using namespace test;

TEST(InstanceMap, InsertsNewKeysInOrderAndRefusesKeyEqualOnes) {
  Instance_Map<T_Device> map;
  EXPECT_EQ(map.insert(make_device("a", 1).release()), 0u);
  EXPECT_EQ(map.insert(make_device("b", 1).release()), 1u);
  const Ref<T_Device> again = make_device("a", 1);
  EXPECT_EQ(map.insert(again.get()), Instance_Map_Base::npos);
  EXPECT_EQ(again->refs.load(), 1u);
  EXPECT_EQ(map.size(), 2u);
  EXPECT_STREQ(map[1]->Name.value.c_str(), "b");
  EXPECT_EQ(map.meta_class(), &T_Device::static_meta_class);
}

TEST(InstanceMap, FindsAndLooksUpByKeys) {
  Instance_Map<T_Device> map;
  map.insert(make_device("a", 1).release());
  map.insert(make_device("b", 2).release());
  EXPECT_EQ(map.find(make_device("b", 2).get()), 1u);
  EXPECT_EQ(map.find(make_device("b", 1).get()), Instance_Map_Base::npos);
  EXPECT_EQ(map.lookup(make_device("a", 1).get()), map[0]);
  EXPECT_EQ(map.lookup(make_device("A", 1).get()), nullptr);
  EXPECT_EQ(map.find(nullptr), Instance_Map_Base::npos);
}

TEST(InstanceMap, EmptyOneFindsNothing) {
  const Instance_Map<T_Device> map;
  EXPECT_EQ(map.find(make_device("a", 1).get()), Instance_Map_Base::npos);
}

TEST(InstanceMap, FindsByAModelOfAnotherClass) {
  Instance_Map<T_Device> map;
  map.insert(make_device("a", 1).release());
  const Ref<T_Other> other = make<T_Other>();
  other->name.set("a");
  other->number.set(1u);
  EXPECT_EQ(map.find(other.get()), 0u);
  EXPECT_EQ(map.find(make_device<T_Wide>("a", 1).get()), 0u);
  EXPECT_EQ(map.find(make_device<T_Narrow>("a", 1).get()), Instance_Map_Base::npos);
  EXPECT_EQ(map.find(make<T_Link>().get()), Instance_Map_Base::npos);
}

TEST(InstanceMap, GetInstanceClonesOrAnswers60) {
  Instance_Map<T_Device> map;
  map.insert(make_device("a", 1).release());
  Instance* out = nullptr;
  ASSERT_EQ(map.get_instance(make_device("a", 1).get(), out), 0);
  const Ref<Instance> copy(out);
  EXPECT_NE(out, map[0]);
  EXPECT_TRUE(identical(out, map[0]));
  Instance* untouched = out;
  EXPECT_EQ(map.get_instance(make_device("x", 1).get(), untouched), 60);
  EXPECT_EQ(untouched, out);
}

TEST(InstanceMap, EnumInstancesDeliversClonesUntilToldToStop) {
  Instance_Map<T_Device> map;
  for (std::uint32_t i = 0; i < 5; ++i) map.insert(make_device("a", i).release());
  struct Seen {
    std::vector<std::uint32_t> numbers;
    std::size_t limit;
  } seen{{}, 3};
  const Instance_Handler handler{[](Instance* instance, std::int32_t status, void* data) {
                                   const Ref<T_Device> device(static_cast<T_Device*>(instance));
                                   EXPECT_EQ(status, 0);
                                   auto* s = static_cast<Seen*>(data);
                                   s->numbers.push_back(device->Number.value);
                                   return s->numbers.size() < s->limit;
                                 },
                                 &seen};
  EXPECT_EQ(map.enum_instances(handler), 0);
  EXPECT_EQ(seen.numbers, (std::vector<std::uint32_t>{0, 1, 2}));
  seen = {{}, 100};
  EXPECT_EQ(map.enum_instances(handler), 0);
  EXPECT_EQ(seen.numbers.size(), 5u);
  EXPECT_EQ(map.size(), 5u);
}

TEST(InstanceMap, CreateInstanceInsertsACloneOrAnswers80) {
  Instance_Map<T_Device> map;
  const Ref<T_Device> device = make_device("a", 1);
  EXPECT_EQ(map.create_instance(device.get()), 0);
  EXPECT_NE(map[0], device.get());
  device->Caption.set("changed");
  EXPECT_EQ(map.create_instance(device.get()), 80);
  EXPECT_EQ(map.size(), 1u);
  EXPECT_TRUE(map[0]->Caption.is_null());
}

TEST(InstanceMap, ModifyInstanceCopiesWhatTheModelNamesOrAnswers100) {
  Instance_Map<T_Device> map;
  map.insert(make_device("a", 1).release());
  const Ref<T_Device> model = make_device("a", 1);
  model->Caption.set("");
  const Ref<T_Device> instance = make_device("a", 1);
  instance->Caption.set("new caption");
  instance->Speed.set(std::uint64_t{5});
  EXPECT_EQ(map.modify_instance(model.get(), instance.get()), 0);
  EXPECT_STREQ(map[0]->Caption.value.c_str(), "new caption");
  EXPECT_TRUE(map[0]->Speed.is_null());
  EXPECT_EQ(map.modify_instance(make_device("x", 1).get(), instance.get()), 100);
}

TEST(InstanceMap, ModifyInstanceThatChangesAKeyIsFoundUnderTheNewOne) {
  Instance_Map<T_Device> map;
  map.insert(make_device("a", 1).release());
  map.insert(make_device("b", 1).release());
  EXPECT_EQ(map.modify_instance(make_device("a", 1).get(), make_device("c", 1).get()), 0);
  EXPECT_EQ(map.find(make_device("a", 1).get()), Instance_Map_Base::npos);
  EXPECT_EQ(map.find(make_device("c", 1).get()), 0u);
}

TEST(InstanceMap, DeleteInstanceRemovesOrAnswers90) {
  Instance_Map<T_Device> map;
  for (std::uint32_t i = 0; i < 4; ++i) map.insert(make_device("a", i).release());
  EXPECT_EQ(map.delete_instance(make_device("a", 1).get()), 0);
  EXPECT_EQ(map.delete_instance(make_device("a", 1).get()), 90);
  ASSERT_EQ(map.size(), 3u);
  EXPECT_EQ(map.find(make_device("a", 0).get()), 0u);
  EXPECT_EQ(map.find(make_device("a", 2).get()), 1u);
  EXPECT_EQ(map.find(make_device("a", 3).get()), 2u);
}

TEST(InstanceMap, ClearEmptiesAndTheMapCanBeFilledAgain) {
  Instance_Map<T_Device> map;
  for (std::uint32_t i = 0; i < 100; ++i) map.insert(make_device("a", i).release());
  map.clear();
  EXPECT_EQ(map.size(), 0u);
  EXPECT_EQ(map.find(make_device("a", 1).get()), Instance_Map_Base::npos);
  EXPECT_EQ(map.insert(make_device("a", 1).release()), 0u);
}

TEST(InstanceMap, TakesAnInstanceOverUnlessItsKeysAreThere) {
  Instance_Map<T_Device> map;
  Ref<Instance> device(make_device("a", 1).release());
  EXPECT_EQ(map.take(device), 0u);
  EXPECT_FALSE(device);
  Ref<Instance> again(make_device("a", 1).release());
  EXPECT_EQ(map.take(again), Instance_Map_Base::npos);
  EXPECT_TRUE(again);
  EXPECT_EQ(map.size(), 1u);
  map[0]->Number.set(2u);
  EXPECT_EQ(map.take(again), 1u) << "an entry that was fetched is looked at again";
  EXPECT_EQ(map.find(make_device("a", 2).get()), 0u);
}

TEST(InstanceMap, RoomMadeBeforehandChangesNothingElse) {
  Instance_Map<T_Device> map;
  for (std::uint32_t i = 0; i < 5; ++i) map.insert(make_device("a", i).release());
  map.reserve(1000);
  map.reserve(2);
  for (std::uint32_t i = 5; i < 1500; ++i) map.insert(make_device("a", i).release());
  for (std::uint32_t i = 0; i < 1500; ++i)
    ASSERT_EQ(map.find(make_device("a", i).get()), std::size_t{i});
}

TEST(InstanceMap, ShortenDestroysTheLastEntries) {
  Instance_Map<T_Device> map;
  for (std::uint32_t i = 0; i < 100; ++i) map.insert(make_device("a", i).release());
  map[90]->Number.set(900u);  // checked again, but gone by then
  map[10]->Number.set(1000u);
  map.shorten(200);
  EXPECT_EQ(map.size(), 100u);
  map.shorten(60);
  map.shorten(40);
  EXPECT_EQ(map.size(), 40u);
  EXPECT_EQ(map.find(make_device("a", 39).get()), 39u);
  EXPECT_EQ(map.find(make_device("a", 1000).get()), 10u);
  EXPECT_EQ(map.find(make_device("a", 40).get()), Instance_Map_Base::npos);
  EXPECT_EQ(map.insert(make_device("a", 40).release()), 40u);
  EXPECT_EQ(map.find(make_device("a", 40).get()), 40u);
  map.shorten(0);
  EXPECT_EQ(map.find(make_device("a", 1).get()), Instance_Map_Base::npos);
  EXPECT_EQ(map.insert(make_device("a", 1).release()), 0u);
}

struct Drained {
  std::vector<std::uint32_t> numbers;
  std::size_t wanted;
};

bool keep_number(Instance* instance, std::int32_t, void* data) {
  const Ref<Instance> owner(instance);
  auto& drained = *static_cast<Drained*>(data);
  drained.numbers.push_back(static_cast<T_Device*>(instance)->Number.value);
  if (drained.wanted == 0) throw std::runtime_error("no more");
  return drained.numbers.size() < drained.wanted;
}

TEST(InstanceMap, DrainDeliversClonesAndLeavesNothing) {
  Instance_Map<T_Device> map;
  for (std::uint32_t i = 0; i < 3; ++i) map.insert(make_device("a", i).release());
  Drained all{{}, 10};
  map.drain({keep_number, &all});
  EXPECT_EQ(all.numbers, (std::vector<std::uint32_t>{0, 1, 2}));
  EXPECT_EQ(map.size(), 0u);
  for (std::uint32_t i = 0; i < 3; ++i) map.insert(make_device("a", i).release());
  Drained two{{}, 2};
  map.drain({keep_number, &two});
  EXPECT_EQ(two.numbers.size(), 2u);
  EXPECT_EQ(map.size(), 0u);
}

TEST(InstanceMap, DrainThatIsBrokenOffLeavesNothingToo) {
  Instance_Map<T_Device> map;
  for (std::uint32_t i = 0; i < 3; ++i) map.insert(make_device("a", i).release());
  Drained none{{}, 0};
  EXPECT_THROW(map.drain({keep_number, &none}), std::runtime_error);
  EXPECT_EQ(none.numbers.size(), 1u);
  EXPECT_EQ(map.size(), 0u);
  EXPECT_EQ(map.find(make_device("a", 1).get()), Instance_Map_Base::npos);
}

TEST(InstanceMap, FindsAnEntryWhoseKeyWasChangedInPlace) {
  Instance_Map<T_Device> map;
  for (std::uint32_t i = 0; i < 10; ++i) map.insert(make_device("a", i).release());
  map[3]->Name.set("changed");
  EXPECT_EQ(map.find(make_device("changed", 3).get()), 3u);
  EXPECT_EQ(map.find(make_device("a", 3).get()), Instance_Map_Base::npos);
  static_cast<T_Device*>(map.lookup(make_device("a", 4).get()))->Number.set(44u);
  EXPECT_EQ(map.find(make_device("a", 44).get()), 4u);
  EXPECT_EQ(map.insert(make_device("a", 4).release()), 10u);
}

TEST(InstanceMap, FindsAnEntryThatWasFilledInAfterItsInsertion) {
  Instance_Map<T_Device> map;
  T_Device* device = make<T_Device>().release();
  map.insert(device);
  device->Name.set("late");
  device->Number.set(5u);
  EXPECT_EQ(map.find(make_device("late", 5).get()), 0u);
}

TEST(InstanceMap, KeyChangedFollowsAPointerThatWasKept) {
  Instance_Map<T_Device> map;
  for (std::uint32_t i = 0; i < 10; ++i) map.insert(make_device("a", i).release());
  T_Device* kept = map[3];
  EXPECT_EQ(map.find(make_device("a", 3).get()), 3u);
  kept->Name.set("changed");
  map.key_changed(3);
  EXPECT_EQ(map.find(make_device("changed", 3).get()), 3u);
  EXPECT_EQ(map.find(make_device("a", 3).get()), Instance_Map_Base::npos);
}

TEST(InstanceMap, RemovingAnEntryKeepsThoseThatWereChangedBehindIt) {
  Instance_Map<T_Device> map;
  for (std::uint32_t i = 0; i < 10; ++i) map.insert(make_device("a", i).release());
  EXPECT_EQ(map.find(make_device("a", 9).get()), 9u);
  map[8]->Number.set(80u);  // to be checked again
  EXPECT_EQ(map.delete_instance(make_device("a", 2).get()), 0);
  map[7]->Number.set(81u);
  EXPECT_EQ(map.find(make_device("a", 81).get()), 7u);
  EXPECT_EQ(map.find(make_device("a", 80).get()), Instance_Map_Base::npos);
  EXPECT_EQ(map.find(make_device("a", 9).get()), 8u);
}

TEST(InstanceMap, FindsByKeysThatAreRealsAndArrays) {
  Meta_Class* mc = create_meta_class("X_Keys", nullptr, FLAG_CLASS);
  add_feature(mc, create_property("Real", REAL32, 0, 24, true));
  add_feature(mc, create_property("Numbers", UINT16, -1, 32, true));
  const auto make_entry = [&](float real, std::initializer_list<std::uint16_t> numbers) {
    Ref<Instance> instance(create(mc, true));
    for (const char* name : {"Real", "Numbers"})
      *null_flag(instance.get(), find_property(mc, name)) = 0;
    *static_cast<float*>(storage(instance.get(), find_property(mc, "Real"))) = real;
    auto& array =
        *static_cast<Array<std::uint16_t>*>(storage(instance.get(), find_property(mc, "Numbers")));
    for (const std::uint16_t number : numbers) array.append(number);
    return instance;
  };
  {
    Instance_Map_Base map(mc);
    EXPECT_EQ(map.insert(make_entry(0.5F, {1, 2}).release()), 0u);
    EXPECT_EQ(map.insert(make_entry(0.5F, {2, 1}).release()), 1u);
    EXPECT_EQ(map.insert(make_entry(0.0F, {}).release()), 2u);
    EXPECT_EQ(map.find(make_entry(0.5F, {2, 1}).get()), 1u);
    EXPECT_EQ(map.find(make_entry(-0.0F, {}).get()), 2u) << "both zeros are one key";
    EXPECT_EQ(map.find(make_entry(0.5F, {1}).get()), Instance_Map_Base::npos);
    const Ref<Instance> again = make_entry(0.5F, {1, 2});
    EXPECT_EQ(map.insert(again.get()), Instance_Map_Base::npos);
  }
  unref(mc);
}

TEST(InstanceMap, NeverAnswersAnEntryThatIsNotKeyEqual) {
  Instance_Map<T_Device> map;
  map.insert(make_device("a", 3).release());
  T_Device* kept = map[0];
  EXPECT_EQ(map.find(make_device("a", 3).get()), 0u);
  kept->Name.set("changed");
  EXPECT_EQ(map.find(make_device("a", 3).get()), Instance_Map_Base::npos);
}

TEST(InstanceMap, AnswersTheFirstOfSeveralKeyEqualEntries) {
  Instance_Map<T_Device> map;
  for (std::uint32_t i = 0; i < 10; ++i) map.insert(make_device("a", i).release());
  map[7]->Number.set(2u);
  EXPECT_EQ(map.find(make_device("a", 2).get()), 2u);
  map[1]->Number.set(2u);
  EXPECT_EQ(map.find(make_device("a", 2).get()), 1u);
  EXPECT_EQ(map.delete_instance(make_device("a", 2).get()), 0);
  EXPECT_EQ(map.find(make_device("a", 2).get()), 1u);
}

TEST(InstanceMap, FollowsAChangeBehindAReferenceKey) {
  Instance_Map<T_Link> map;
  map.insert(make_link(make_device("a", 1), make_device("b", 2)).release());
  map[0]->Dependent->Name.set("c");
  const Ref<T_Link> model = make_link(make_device("a", 1), make_device("c", 2));
  EXPECT_EQ(map.find(model.get()), 0u);
  set_reference(map[0]->Dependent, static_cast<T_Device*>(nullptr));
  EXPECT_EQ(map.find(model.get()), Instance_Map_Base::npos);
  set_reference(model->Dependent, static_cast<T_Device*>(nullptr));
  EXPECT_EQ(map.find(model.get()), 0u);
}

/// Answers of a map, found by a scan of the whole list.
std::size_t linear_find(const std::vector<Instance*>& list, const Instance* model) {
  for (std::size_t i = 0; i < list.size(); ++i)
    if (key_eq(list[i], model)) return i;
  return Instance_Map_Base::npos;
}

/// Random instances of many classes with few different keys, so that key-equal ones are frequent.
class Instance_Maker {
 public:
  explicit Instance_Maker(unsigned seed) : _random(seed) {}

  std::size_t below(std::size_t n) { return _random() % n; }

  Instance* make_any() {
    switch (below(9)) {
      case 0:
        return make_named<T_Port>();
      case 1:
        return make_named<T_Wide>();
      case 2:
        return make_named<T_Narrow>();
      case 3: {
        Ref<T_Other> other = make<T_Other>();
        other->name.set(name());
        other->number.set(number());
        return other.release();
      }
      case 4:
      case 5:
        return make_link<T_Link>(end<T_Device>(), end<T_Device>()).release();
      case 6:
        return make_link<T_Port_Link>(end<T_Device>(), end<T_Port>()).release();
      case 7:
        return make_timed();
      default:
        return make_named<T_Device>();
    }
  }

  /// Changes a key of an instance that `make_any` made.
  void change(Instance* instance) {
    const Meta_Record* record = instance->meta_class;
    if (record == &T_Link::static_meta_class) {
      auto* link = static_cast<T_Link*>(instance);
      set_reference(link->Dependent, end<T_Device>().release());
    } else if (record == &T_Timed::static_meta_class) {
      static_cast<T_Timed*>(instance)->Stamp.set(Datetime(below(3), 0));
    } else if (const Meta_Property* p = find_property(record, "Name")) {
      static_cast<String*>(storage(instance, p))->assign(name());
    }
  }

 private:
  const char* name() {
    static constexpr const char* names[] = {"", "a", "b", "a longer name than one word"};
    return names[below(4)];
  }
  std::uint32_t number() { return static_cast<std::uint32_t>(below(3)); }

  template <class T>
  Instance* make_named() {
    Ref<T> device = make_device<T>(name(), number());
    if (below(8) == 0) device->Number.null = 1;
    return device.release();
  }

  /// One end of a link: of the class itself or, for a device, of its subclass, or null.
  template <class T>
  Ref<T> end() {
    if (below(6) == 0) return Ref<T>();
    if (below(4) == 0)
      return Ref<T>(
          static_cast<T*>(static_cast<Instance*>(make_device<T_Port>(name(), number()).release())));
    return make_device<T>(name(), number());
  }

  Instance* make_timed() {
    Ref<T_Timed> timed = make<T_Timed>();
    timed->Stamp.set(below(2) ? Datetime(below(3))
                              : Datetime(below(3), static_cast<int>(below(2))));
    timed->Ratio.set(below(2) ? 0.0 : -0.0);
    timed->Flag.set(below(2) != 0);
    timed->Letter.set(static_cast<char16_t>('a' + below(2)));
    return timed.release();
  }

  std::mt19937 _random;
};

class Instance_Map_Property : public testing::TestWithParam<unsigned> {};

TEST_P(Instance_Map_Property, AnswersLikeALinearListOnRandomInstances) {
  Instance_Maker maker(GetParam());
  Instance_Map_Base map(&Instance::static_meta_class);
  std::vector<Instance*> list;  // the same pointers, owned by the map
  for (int step = 0; step < 4000; ++step) {
    Ref<Instance> model(maker.make_any());
    const std::size_t expected = linear_find(list, model.get());
    ASSERT_EQ(map.find(model.get()), expected);
    switch (maker.below(5)) {
      case 0:
      case 1: {
        const std::size_t i = map.insert(model.get());
        ASSERT_EQ(i, expected == Instance_Map_Base::npos ? list.size() : Instance_Map_Base::npos);
        if (i != Instance_Map_Base::npos) list.push_back(model.release());
        break;
      }
      case 2:
        ASSERT_EQ(map.delete_instance(model.get()), expected == Instance_Map_Base::npos ? 90 : 0);
        if (expected != Instance_Map_Base::npos)
          list.erase(list.begin() + static_cast<std::ptrdiff_t>(expected));
        break;
      case 3:
        if (!list.empty()) maker.change(map.at(maker.below(list.size())));
        break;
      default:
        if (!list.empty()) {
          const std::size_t i = maker.below(list.size());
          maker.change(list[i]);
          map.key_changed(i);
        }
        break;
    }
    ASSERT_EQ(map.size(), list.size());
    if (maker.below(500) == 0) {
      map.clear();
      list.clear();
    }
  }
}

INSTANTIATE_TEST_SUITE_P(Seeds, Instance_Map_Property, testing::Range(1u, 9u));

TEST(InstanceMap, TenThousandEntriesAreFoundByTheirKeys) {
  Instance_Map<T_Device> map;
  for (std::uint32_t i = 0; i < 10000; ++i)
    ASSERT_EQ(map.insert(make_device(std::to_string(i).c_str(), i).release()), i);
  for (std::uint32_t i = 0; i < 10000; i += 7)
    ASSERT_EQ(map.find(make_device(std::to_string(i).c_str(), i).get()), i);
  EXPECT_EQ(map.find(make_device("5", 6).get()), Instance_Map_Base::npos);
}

}  // namespace
}  // namespace cimrt
