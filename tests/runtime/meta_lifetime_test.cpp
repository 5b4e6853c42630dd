// Classes made at run time: creation, copies, qualifiers, dumps and destruction.
#include <gtest/gtest.h>

#include <cstdlib>
#include <cstring>
#include <new>
#include <string>

#include "Test_Schema.h"
#include "runtime/Meta_Class.h"

namespace {

/// Block whose release is watched, and whether it was overwritten by then.
const void* watched_block = nullptr;
std::size_t watched_size = 0;
bool was_overwritten = false;

void look_at(const void* block) noexcept {
  if (!block || block != watched_block) return;
  const auto* bytes = static_cast<const unsigned char*>(block);
  was_overwritten = true;
  for (std::size_t i = 0; i < watched_size; ++i)
    was_overwritten = was_overwritten && bytes[i] == 0xDD;
  watched_block = nullptr;
}

}  // namespace

// Replaced so that a test sees a block as it is released. Never inlined: a compiler that sees
// malloc and free on one side only takes the pair for mismatched.
[[gnu::noinline]] void* operator new(std::size_t n) {
  if (void* block = std::malloc(n)) return block;
  throw std::bad_alloc();
}
[[gnu::noinline]] void operator delete(void* block) noexcept {
  look_at(block);
  std::free(block);
}
[[gnu::noinline]] void operator delete(void* block, std::size_t) noexcept {
  look_at(block);
  std::free(block);
}

namespace cimrt {
namespace {

using namespace test;

Meta_Qualifier* make_qualifier(const char* name, const char* text) {
  Meta_Qualifier source{0, name, STRING, 0, nullptr};
  const Meta_Value value{text, 1};
  source.value = text ? &value : nullptr;
  return clone(&source);
}

std::string printed(const Meta_Class* mc, bool qualifiers) {
  testing::internal::CaptureStdout();
  print(mc, qualifiers);
  std::fflush(stdout);
  return testing::internal::GetCapturedStdout();
}

TEST(RunTimeClass, CloneIsDeepAndBelongsToNoRepository) {
  Meta_Class* copy = clone(&T_All::static_meta_class);
  EXPECT_EQ(copy->refs.load(), 1u);
  EXPECT_EQ(copy->meta_repository, nullptr);
  EXPECT_EQ(copy->num_keys, 1u);
  EXPECT_NE(copy->name, T_All::static_meta_class.name);
  EXPECT_NE(copy->meta_features[0], T_All::static_meta_class.meta_features[0]);
  EXPECT_TRUE(identical(copy, &T_All::static_meta_class));
  unref(copy);
}

TEST(RunTimeClass, InstancesOfACloneWorkAndKeepItAlive) {
  Meta_Class* copy = clone(&T_All::static_meta_class);
  Instance* instance = create(copy, true);
  EXPECT_EQ(copy->refs.load(), 2u);
  unref(copy);
  const auto* all = static_cast<T_All*>(instance);
  EXPECT_STREQ(all->Id.value.c_str(), "all");
  EXPECT_EQ(all->Uint16s.value.size(), 3u);
  Instance* second = clone(instance);
  unref(instance);
  EXPECT_STREQ(static_cast<T_All*>(second)->Texts.value[1].c_str(), "b");
  unref(second);
}

TEST(RunTimeClass, WithoutASuperclassIsEmpty) {
  Meta_Class* mc = create_meta_class("X_New", nullptr, FLAG_ASSOCIATION | FLAG_ABSTRACT);
  EXPECT_STREQ(mc->name, "X_New");
  EXPECT_EQ(mc->flags, FLAG_ASSOCIATION | FLAG_ABSTRACT);
  EXPECT_EQ(mc->refs.load(), 1u);
  EXPECT_EQ(mc->num_meta_features, 0u);
  EXPECT_EQ(mc->size, sizeof(Instance));
  EXPECT_EQ(mc->super_meta_class, nullptr);
  unref(mc);
}

TEST(RunTimeClass, WithASuperclassInheritsAllAndIsNotAbstract) {
  Meta_Class* super = clone(&T_Port::static_meta_class);
  super->flags |= FLAG_ABSTRACT;
  add_qualifier(super, make_qualifier("abstract", nullptr));
  add_qualifier(super, make_qualifier("Description", "text"));
  Meta_Class* mc = create_meta_class("X_Port", super, 0);
  EXPECT_STREQ(mc->name, "X_Port");
  EXPECT_EQ(mc->flags, static_cast<std::uint32_t>(FLAG_CLASS));
  EXPECT_EQ(mc->num_meta_features, super->num_meta_features);
  ASSERT_EQ(mc->num_meta_qualifiers, 1u);
  EXPECT_STREQ(mc->meta_qualifiers[0]->name, "Description");
  for (std::uint64_t i = 0; i < mc->num_meta_features; ++i) EXPECT_EQ(mc->locals[i], 0);
  EXPECT_EQ(mc->super_meta_class, super);
  EXPECT_EQ(super->refs.load(), 2u);
  EXPECT_TRUE(is_subclass(&T_Device::static_meta_class, mc));
  unref(mc);
  EXPECT_EQ(super->refs.load(), 1u);
  unref(super);
}

TEST(RunTimeClass, CreatePropertySetsTheFlags) {
  Meta_Property* plain = create_property("Plain", UINT16, -1, 24, false);
  EXPECT_EQ(plain->flags, FLAG_PROPERTY | FLAG_READ);
  EXPECT_EQ(plain->type, UINT16);
  EXPECT_EQ(plain->subscript, -1);
  EXPECT_EQ(plain->offset, 24u);
  unref(plain);
  Meta_Property* key = create_property("Id", STRING, 0, 24, true);
  EXPECT_EQ(key->flags, FLAG_PROPERTY | FLAG_READ | FLAG_KEY);
  unref(key);
}

TEST(RunTimeClass, GrowsByTheFeaturesThatAreAdded) {
  Meta_Class* mc = create_meta_class("X_New", nullptr, FLAG_CLASS);
  add_feature(mc, create_property("Id", STRING, 0, 24, true));
  add_feature(mc, create_property("Count", UINT16, 0, 40, false));
  EXPECT_EQ(mc->size, 48u);
  EXPECT_EQ(mc->num_keys, 1u);
  EXPECT_EQ(mc->locals[1], 1);
  Instance* instance = create(mc, true);
  static_cast<String*>(storage(instance, find_property(mc, "id")))->assign("text");
  *null_flag(instance, find_property(mc, "Id")) = 0;
  EXPECT_TRUE(keys_non_null(instance));
  unref(instance);
  unref(mc);
}

TEST(RunTimeClass, ReferencesShareAndCountTheirClass) {
  Meta_Class* target = clone(&T_Device::static_meta_class);
  Meta_Reference source{{0, FLAG_REFERENCE, "Other", nullptr, 0}, 0, target, 24};
  Meta_Class* mc = create_meta_class("X_Link", nullptr, FLAG_ASSOCIATION);
  add_feature(mc, clone(static_cast<const Meta_Feature*>(&source)));
  EXPECT_EQ(target->refs.load(), 2u);
  Meta_Class* copy = clone(mc);
  EXPECT_EQ(target->refs.load(), 3u);
  EXPECT_EQ(find_reference(copy, "Other")->meta_class, target);
  unref(mc);
  unref(copy);
  EXPECT_EQ(target->refs.load(), 1u);
  unref(target);
}

TEST(RunTimeClass, IsOverwrittenWhenItDies) {
  Meta_Class* mc = clone(&T_Device::static_meta_class);
  ref(mc);
  watched_block = mc;
  watched_size = sizeof(Meta_Class);
  was_overwritten = false;
  unref(mc);
  EXPECT_EQ(watched_block, mc);
  unref(mc);
  EXPECT_EQ(watched_block, nullptr);
  EXPECT_TRUE(was_overwritten);
}

TEST(RunTimeClass, FilterRemovesNamedQualifiersFromTheClassAndItsMethods) {
  Meta_Class* mc = clone(&T_Device::static_meta_class);
  auto* method = const_cast<Meta_Method*>(find_method(mc, "Reset"));
  for (Meta_Feature* f : {static_cast<Meta_Feature*>(mc), static_cast<Meta_Feature*>(method)}) {
    add_qualifier(f, make_qualifier("Description", "text"));
    add_qualifier(f, make_qualifier("Version", "1"));
  }
  const char* const names[] = {"VERSION"};
  filter_qualifiers(mc, names, 1);
  ASSERT_EQ(mc->num_meta_qualifiers, 1u);
  ASSERT_EQ(method->num_meta_qualifiers, 1u);
  EXPECT_STREQ(method->meta_qualifiers[0]->name, "Description");
  filter_qualifiers(mc, nullptr, 0);
  EXPECT_EQ(mc->num_meta_qualifiers, 0u);
  EXPECT_EQ(method->num_meta_qualifiers, 0u);
  unref(mc);
}

TEST(RunTimeClass, IdenticalSeesEveryDifference) {
  const Meta_Class* source = &T_All::static_meta_class;
  const auto differs_after = [&](void (*change)(Meta_Class*)) {
    Meta_Class* copy = clone(source);
    change(copy);
    const bool same = identical(copy, source);
    unref(copy);
    return !same;
  };
  EXPECT_FALSE(differs_after([](Meta_Class*) {}));
  EXPECT_TRUE(differs_after([](Meta_Class* mc) { mc->flags |= FLAG_TERMINAL; }));
  EXPECT_TRUE(differs_after([](Meta_Class* mc) { mc->num_keys = 0; }));
  EXPECT_TRUE(differs_after([](Meta_Class* mc) { add_qualifier(mc, make_qualifier("Q", "x")); }));
  EXPECT_TRUE(differs_after([](Meta_Class* mc) {
    const_cast<Meta_Property*>(find_property(mc, "Uint8"))->type = SINT8;
  }));
  EXPECT_TRUE(differs_after([](Meta_Class* mc) {
    auto* value = const_cast<Meta_Value*>(find_property(mc, "Uint16s")->value);
    *static_cast<std::uint16_t*>(const_cast<void*>(value->data)) = 99;
  }));
  EXPECT_FALSE(identical(source, nullptr));
  EXPECT_FALSE(identical(&T_Device::static_meta_class, &T_Port::static_meta_class));
}

TEST(RunTimeClass, IdenticalComparesQualifiersMethodsAndReferences) {
  const auto same_after = [](const Meta_Class* source, void (*change)(Meta_Class*)) {
    Meta_Class* left = clone(source);
    Meta_Class* right = clone(source);
    add_qualifier(left, make_qualifier("Description", "text"));
    add_qualifier(right, make_qualifier("description", "text"));
    EXPECT_TRUE(identical(left, right)) << source->name;
    change(right);
    const bool same = identical(left, right);
    unref(left);
    unref(right);
    return same;
  };
  EXPECT_FALSE(same_after(&T_Device::static_meta_class, [](Meta_Class* mc) {
    const_cast<Meta_Qualifier*>(mc->meta_qualifiers[0])->type = DATETIME;
  }));
  EXPECT_FALSE(same_after(&T_Device::static_meta_class, [](Meta_Class* mc) {
    add_qualifier(mc, make_qualifier("Version", "1"));
  }));
  EXPECT_FALSE(same_after(&T_Device::static_meta_class, [](Meta_Class* mc) {
    for (std::uint64_t i = 0; i < mc->num_meta_features; ++i)
      if (is_method(mc->meta_features[i]))
        const_cast<Meta_Method*>(as_method(mc->meta_features[i]))->return_type = REAL64;
  }));
  EXPECT_FALSE(same_after(&T_Link::static_meta_class, [](Meta_Class* mc) {
    auto* reference = const_cast<Meta_Reference*>(find_reference(mc, "Dependent"));
    unref(reference->meta_class);
    reference->meta_class = &T_Port::static_meta_class;
  }));
}

TEST(ClassDump, ShowsTheClassItsFlagsAndItsMembers) {
  EXPECT_EQ(printed(&T_Port::static_meta_class, false),
            "class T_Port : T_Device\n"
            "{\n"
            "    [Key]\n"
            "    string Name;\n"
            "    [Key]\n"
            "    uint32 Number;\n"
            "    string Caption;\n"
            "    uint64 Speed;\n"
            "    uint32 Reset(\n"
            "        [In]\n"
            "        uint16 Mode,\n"
            "        [In(False), Out]\n"
            "        string Answer,\n"
            "        [In]\n"
            "        T_Device REF Target\n"
            "    );\n"
            "    uint16 Kind;\n"
            "};\n");
}

TEST(ClassDump, ShowsReferencesAndDefaults) {
  EXPECT_EQ(printed(&T_Meta_Link::static_meta_class, false),
            "[Association]\n"
            "class T_Meta_Link\n"
            "{\n"
            "    [Key]\n"
            "    T_Link REF Link;\n"
            "};\n");
  const std::string all = printed(&T_All::static_meta_class, false);
  EXPECT_NE(all.find("    string Id = \"all\";\n"), std::string::npos);
  EXPECT_NE(all.find("    uint16 Uint16 = 7;\n"), std::string::npos);
  EXPECT_NE(all.find("    uint16 Uint16s[] = { 1, 2, 3};\n"), std::string::npos);
  EXPECT_NE(all.find("    string Texts[] = { \"a\", \"b\"};\n"), std::string::npos);
}

TEST(ClassDump, ShowsReadOnlyWhenItIsFalse) {
  Meta_Class* mc = clone(&T_Layout::static_meta_class);
  const_cast<Meta_Property*>(find_property(mc, "B"))->flags &= ~std::uint32_t{FLAG_READ};
  const std::string text = printed(mc, false);
  EXPECT_NE(text.find("    uint16 A;\n    [Read(False)]\n    uint16 B;\n"), std::string::npos);
  unref(mc);
}

TEST(ClassDump, ShowsQualifiersThatAreNoFlagsWhenAsked) {
  Meta_Class* mc = create_meta_class("X_New", nullptr, FLAG_CLASS | FLAG_ABSTRACT);
  add_qualifier(mc, make_qualifier("Abstract", nullptr));
  add_qualifier(mc, make_qualifier("Version", "2.0"));
  EXPECT_EQ(printed(mc, true), "[Abstract, Version(\"2.0\")]\nclass X_New\n{\n};\n");
  EXPECT_EQ(printed(mc, false), "[Abstract]\nclass X_New\n{\n};\n");
  unref(mc);
}

TEST(ClassDumpDeathTest, AMethodWithoutReturnValueFailsAnAssertion) {
  Meta_Method method{{{0, FLAG_METHOD, "Bad", nullptr, 0}, nullptr, 0, sizeof(Instance)}, UINT32};
  const Meta_Feature* const features[] = {&method};
  const std::uint8_t locals[] = {1};
  const Meta_Class mc{{{0, FLAG_CLASS, "X_Bad", nullptr, 0}, features, 1, sizeof(Instance)},
                      locals,
                      nullptr,
                      0,
                      nullptr};
  EXPECT_DEATH(print(&mc, false), "assert: mm->num_meta_features > 0");
}

}  // namespace
}  // namespace cimrt
