// Comparing, visiting, association tests and dumps of instances.
#include <gtest/gtest.h>

#include <cmath>
#include <string>
#include <vector>

#include "Captured_Stream.h"
#include "Test_Schema.h"

namespace cimrt {
namespace {

using namespace test;

TEST(KeyEq, OfDifferentClassesWithTheSameKeysIsTrue) {
  const Ref<T_Device> device = make_device("a", 1);
  const Ref<T_Other> other = make<T_Other>();
  other->name.set("a");
  other->number.set(1u);
  EXPECT_TRUE(key_eq(device.get(), other.get()));
  EXPECT_TRUE(key_eq(other.get(), device.get()));
  other->number.set(2u);
  EXPECT_FALSE(key_eq(device.get(), other.get()));
}

TEST(KeyEq, IsCaseSensitiveOnStrings) {
  EXPECT_FALSE(key_eq(make_device("a", 1).get(), make_device("A", 1).get()));
}

TEST(KeyEq, IsDrivenByItsFirstArgument) {
  const Ref<T_Device> device = make_device("a", 1);
  const Ref<T_Wide> wide = make_device<T_Wide>("a", 1);
  EXPECT_TRUE(key_eq(device.get(), wide.get()));
  EXPECT_FALSE(key_eq(wide.get(), device.get()));
}

TEST(KeyEq, NeedsTheSameType) {
  const Ref<T_Narrow> narrow = make_device<T_Narrow>("a", 1);
  EXPECT_FALSE(key_eq(make_device("a", 1).get(), narrow.get()));
  EXPECT_FALSE(key_eq(narrow.get(), make_device("a", 1).get()));
}

TEST(KeyEq, IgnoresNonKeys) {
  const Ref<T_Device> a = make_device("a", 1);
  const Ref<T_Device> b = make_device("a", 1);
  b->Caption.set("other");
  EXPECT_TRUE(key_eq(a.get(), b.get()));
}

TEST(KeyEq, ComparesNullFlagsAndTheValuesOfNulls) {
  const Ref<T_Device> a = make_device("a", 1);
  const Ref<T_Device> b = make_device("a", 1);
  b->Number.null = 1;
  EXPECT_FALSE(key_eq(a.get(), b.get()));
  a->Number.null = 7;
  EXPECT_TRUE(key_eq(a.get(), b.get()));
  b->Number.value = 2;
  EXPECT_FALSE(key_eq(a.get(), b.get()));
}

TEST(KeyEq, ComparesReferencesByTheirTargets) {
  const Ref<T_Link> a = make_link(make_device("a", 1), make_device("b", 2));
  const Ref<T_Link> b = make_link(make_device("a", 1), make_device("b", 2));
  EXPECT_TRUE(key_eq(a.get(), b.get()));
  set_reference(b->Dependent, make_device("c", 3).release());
  EXPECT_FALSE(key_eq(a.get(), b.get()));
  set_reference(b->Dependent, static_cast<T_Device*>(nullptr));
  EXPECT_FALSE(key_eq(a.get(), b.get()));
  EXPECT_FALSE(key_eq(b.get(), a.get()));
  set_reference(a->Dependent, static_cast<T_Device*>(nullptr));
  EXPECT_TRUE(key_eq(a.get(), b.get()));
}

TEST(KeyEq, LetsReferencesDifferInClassAlongALineOfDescent) {
  const Ref<T_Link> link = make_link(make_device("a", 1), make_device("b", 2));
  const Ref<T_Port_Link> port_link =
      make_link<T_Port_Link>(make_device("a", 1), make_device<T_Port>("b", 2));
  EXPECT_TRUE(key_eq(link.get(), port_link.get()));
  EXPECT_TRUE(key_eq(port_link.get(), link.get()));
}

TEST(KeyEq, OfAPropertyAndAReferenceOfOneNameIsFalse) {
  const Ref<T_Meta_Link> meta = make<T_Meta_Link>();
  EXPECT_FALSE(key_eq(meta.get(), make_device("a", 1).get()));
}

TEST(KeyEq, OfSpecialTypesComparesTheirWay) {
  const auto make_timed = [](double ratio) {
    Ref<T_Timed> timed = make<T_Timed>();
    timed->Stamp.set(Datetime(1, 2));
    timed->Ratio.set(ratio);
    timed->Flag.set(true);
    timed->Letter.set(u'x');
    return timed;
  };
  EXPECT_TRUE(key_eq(make_timed(0.0).get(), make_timed(-0.0).get()));
  EXPECT_FALSE(key_eq(make_timed(NAN).get(), make_timed(NAN).get()));
  const Ref<T_Timed> other = make_timed(1.0);
  other->Stamp.set(Datetime(1, 3));
  EXPECT_FALSE(key_eq(make_timed(1.0).get(), other.get()));
}

TEST(KeyEq, OfArraysComparesTheirElements) {
  const Ref<T_Array_Key> a = make<T_Array_Key>();
  const Ref<T_Array_Key> b = make<T_Array_Key>();
  a->Numbers.set({1, 2});
  b->Numbers.set({1, 2});
  EXPECT_TRUE(key_eq(a.get(), b.get()));
  b->Numbers.append(3);
  EXPECT_FALSE(key_eq(a.get(), b.get()));
}

TEST(KeyEq, WithoutKeysIsTrueForAnything) {
  EXPECT_TRUE(key_eq(make<T_Empty>().get(), make_device("a", 1).get()));
  EXPECT_FALSE(key_eq(make_device("a", 1).get(), make<T_Empty>().get()));
  EXPECT_FALSE(key_eq(make<T_Empty>().get(), nullptr));
}

TEST(Identical, ComparesClassNamespaceAndEveryFeature) {
  const Ref<T_Group> a = make<T_Group>();
  a->Id.set("id");
  a->Leader = make_device("leader", 1).release();
  a->Members.append(make_device("m", 1).release());
  a->Members.append(nullptr);
  const Ref<T_Group> b(clone(a.get()));
  EXPECT_TRUE(identical(a.get(), b.get()));
  b->__name_space.assign("root");
  EXPECT_FALSE(identical(a.get(), b.get()));
  b->__name_space.clear();
  b->Members.null = 1;
  EXPECT_FALSE(identical(a.get(), b.get()));
  b->Members.null = 0;
  b->Leader->Caption.set("x");
  EXPECT_FALSE(identical(a.get(), b.get()));
  EXPECT_FALSE(identical(make<T_Device>().get(), make<T_Port>().get()));
}

TEST(KeysNonNull, LooksAtReferencesToo) {
  const Ref<T_Link> link = make_link(make_device("a", 1), Ref<T_Device>());
  EXPECT_FALSE(keys_non_null(link.get()));
  link->Dependent = make<T_Device>().release();
  EXPECT_TRUE(keys_non_null(link.get()));
  EXPECT_TRUE(keys_non_null(make<T_Empty>().get()));
}

TEST(CreateSubObjects, FillsNullReferencesOnly) {
  const Ref<T_Link> link = make_link(make_device("a", 1), Ref<T_Device>());
  T_Device* antecedent = link->Antecedent;
  create_sub_objects(link.get());
  EXPECT_EQ(link->Antecedent, antecedent);
  ASSERT_NE(link->Dependent, nullptr);
  EXPECT_TRUE(link->Dependent->Name.is_null());
}

TEST(Visit, CallsTheInstanceFirstAndThenItsTargets) {
  const Ref<T_Group> group = make<T_Group>();
  group->Members.append(make_device("member", 1).release());
  group->Members.append(nullptr);
  group->Embedded = make_device("embedded", 2).release();
  std::vector<Instance*> seen;
  __visit(
      group.get(),
      [](Instance* instance, void* data) {
        static_cast<std::vector<Instance*>*>(data)->push_back(instance);
      },
      &seen);
  EXPECT_EQ(seen, (std::vector<Instance*>{group.get(), group->Members.value[0], group->Embedded}));
}

TEST(SetNameSpace, FillsEmptyOnesOrForcesAll) {
  const Ref<T_Link> link = make_link(make_device("a", 1), make_device("b", 2));
  link->Antecedent->__name_space.assign("root/other");
  set_name_space(link.get(), "root/torvex", false);
  EXPECT_STREQ(link->__name_space.c_str(), "root/torvex");
  EXPECT_STREQ(link->Antecedent->__name_space.c_str(), "root/other");
  EXPECT_STREQ(link->Dependent->__name_space.c_str(), "root/torvex");
  set_name_space(link.get(), "root/x", true);
  EXPECT_STREQ(link->Antecedent->__name_space.c_str(), "root/x");
}

TEST(IsReferenceOf, MatchesClassKeysAndRole) {
  const Ref<T_Device> a = make_device("a", 1);
  const Ref<T_Link> link = make_link(make_device("a", 1), make_device("b", 2));
  EXPECT_TRUE(is_reference_of(a.get(), link.get(), ""));
  EXPECT_TRUE(is_reference_of(a.get(), link.get(), "antecedent"));
  EXPECT_FALSE(is_reference_of(a.get(), link.get(), "Dependent"));
  EXPECT_FALSE(is_reference_of(make_device("c", 1).get(), link.get(), ""));
  const Ref<T_Other> other = make<T_Other>();
  other->name.set("a");
  other->number.set(1u);
  EXPECT_FALSE(is_reference_of(other.get(), link.get(), ""));
  EXPECT_TRUE(is_reference_of(make_device<T_Port>("a", 1).get(), link.get(), ""));
  EXPECT_FALSE(is_reference_of(a.get(), make<T_Link>().get(), ""));
}

TEST(GetAssociators, DeliversTheFarEnds) {
  const Ref<T_Device> a = make_device("a", 1);
  const Ref<T_Port_Link> link =
      make_link<T_Port_Link>(make_device("a", 1), make_device<T_Port>("b", 2));
  Instance* results[MAX_ASSOCIATORS] = {};
  const auto ask = [&](const char* result_class, const char* role, const char* result_role) {
    return get_associators(a.get(), link.get(), result_class, role, result_role, results);
  };
  EXPECT_EQ(ask("", "", ""), 1);
  EXPECT_EQ(results[0], link->Dependent);
  EXPECT_EQ(ask("t_device", "antecedent", "dependent"), 1);
  EXPECT_EQ(ask("T_Port", "", ""), 1);
  EXPECT_EQ(ask("T_Link", "", ""), 0);
  EXPECT_EQ(ask("", "Dependent", ""), -1);
  EXPECT_EQ(ask("", "", "Antecedent"), 0);
}

TEST(GetAssociators, AnswersMinusOneWhenTheSourceIsAtNoEnd) {
  const Ref<T_Link> link = make_link(make_device("a", 1), make_device("b", 2));
  Instance* results[MAX_ASSOCIATORS] = {};
  EXPECT_EQ(get_associators(make_device("c", 1).get(), link.get(), "", "", "", results), -1);
  EXPECT_EQ(get_associators(make_device("c", 1).get(), make<T_Link>().get(), "", "", "", results),
            -1);
}

TEST(GetAssociators, DeliversNothingWhenBothEndsAreTheSource) {
  const Ref<T_Link> link = make_link(make_device("a", 1), make_device("a", 1));
  Instance* results[MAX_ASSOCIATORS] = {};
  EXPECT_EQ(get_associators(make_device("a", 1).get(), link.get(), "", "", "", results), 0);
}

std::string printed(const Instance* instance, bool keys_only = false) {
  Captured_Stream stream;
  print(stream.file(), instance, keys_only);
  return stream.text();
}

TEST(InstanceDump, ShowsEveryFeatureOfTheFirstLevelAndKeysBelow) {
  const Ref<T_Link> link = make_link(make_device("a\"b", 1), Ref<T_Device>());
  link->Antecedent->Caption.set("not shown");
  link->__name_space.assign("root/torvex");
  EXPECT_EQ(printed(link.get()),
            "T_Link\n"
            "{\n"
            "    string __name_space = \"root/torvex\";\n"
            "    T_Device Antecedent =\n"
            "    {\n"
            "        string Name = \"a\\\"b\";\n"
            "        uint32 Number = 1;\n"
            "    }\n"
            "    T_Device Dependent = NULL;\n"
            "    uint16 Weight = NULL;\n"
            "}\n");
}

TEST(InstanceDump, OfKeysShowsKeysOnly) {
  const Ref<T_Device> device = make_device("a", 1);
  device->Caption.set("caption");
  EXPECT_EQ(printed(device.get(), true),
            "T_Device\n{\n    string Name = \"a\";\n    uint32 Number = 1;\n}\n");
}

TEST(InstanceDump, ShowsArraysCharactersAndReals) {
  const Ref<T_All> all = make<T_All>();
  all->Char16.set(u'x');
  all->Char16s.set({u'~', u'\x1F', u'\x0416'});
  all->Real64.set(1.5);
  all->Boolean.set(true);
  all->Sint64.set(std::int64_t{-3});
  const std::string text = printed(all.get());
  for (const char* line :
       {"    string Id = \"all\";\n", "    boolean Boolean = true;\n", "    sint64 Sint64 = -3;\n",
        "    real64 Real64 = 1.500000;\n", "    char16 Char16 = 'x';\n",
        "    datetime When = 00000001020304.000005:000;\n", "    uint16 Uint16s[] = { 1, 2, 3};\n",
        "    char16 Char16s[] = { '~', 0x001F, 0x0416};\n",
        "    string Texts[] = { \"a\", \"b\"};\n", "    uint32 Uint32s[] = NULL;\n"})
    EXPECT_NE(text.find(line), std::string::npos) << line << text;
}

TEST(InstanceDump, ShowsEmbeddedInstancesAtAnyDepthAndReferenceArrays) {
  const Ref<T_Group> group = make<T_Group>();
  group->Id.set("id");
  group->Members.append(make_device("m", 1).release());
  group->Embedded = make_device("e", 2).release();
  EXPECT_EQ(printed(group.get()),
            "T_Group\n"
            "{\n"
            "    string Id = \"id\";\n"
            "    T_Device Members =\n"
            "    {\n"
            "        string Name = \"m\";\n"
            "        uint32 Number = 1;\n"
            "    }\n"
            "    T_Device Leader = NULL;\n"
            "    T_Device Embedded =\n"
            "    {\n"
            "        string Name = \"e\";\n"
            "        uint32 Number = 2;\n"
            "    }\n"
            "}\n");
}

}  // namespace
}  // namespace cimrt
