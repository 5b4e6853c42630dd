// Keys of object paths, in both directions.
#include "Conversion_Fixture.h"

namespace cimrt::test {
namespace {

using ::testing::ElementsAre;

// ---- Keys

class Keys : public Conversion {
 protected:
  Ref<Instance> read_keys(const NamedValues& keys) {
    tvx::host::ObjectPath path = {"", "root/test", "TEST_Keys", keys};
    Instance* out = nullptr;
    EXPECT_EQ(make_cimrt_reference(nullptr, classes.keys, objects.path(path), out), 0);
    return Ref<Instance>(out);
  }
};

TEST_F(Keys, EveryTypeOfKeyGoesThroughBothWays) {
  NamedValues keys;
  for (const Row& row : rows()) keys.set(std::string("K") + short_name(row.type), row.first);
  const Ref<Instance> model = read_keys(keys);
  EXPECT_TRUE(null_in(model.get(), "Note"));
  EXPECT_STREQ(model->__name_space.c_str(), "root/test");
  CMPIObjectPath* path = nullptr;
  ASSERT_EQ(make_CMPI_object_path(face(), model.get(), "root/other", path), 0);
  EXPECT_EQ(contents_of(path).keys, keys);
  EXPECT_EQ(contents_of(path).nameSpace, "root/other");
  EXPECT_EQ(contents_of(path).className, "TEST_Keys");
}

TEST_F(Keys, WideUnsignedKeysAreCutToTheirWidth) {
  NamedValues keys;
  for (const char* name :
       {"Kuint8", "Ksint8", "Kuint16", "Ksint16", "Kuint32", "Ksint32", "Kuint64", "Ksint64"})
    keys.set(name, Any::number(CMPI_uint64, 0x1FFFFFFF80000182));
  const Ref<Instance> model = read_keys(keys);
  EXPECT_EQ(take<std::uint8_t>(model.get(), "Kuint8"), 0x82);
  EXPECT_EQ(take<std::int8_t>(model.get(), "Ksint8"), -126);
  EXPECT_EQ(take<std::uint16_t>(model.get(), "Kuint16"), 0x182);
  EXPECT_EQ(take<std::int16_t>(model.get(), "Ksint16"), 0x182);
  EXPECT_EQ(take<std::uint32_t>(model.get(), "Kuint32"), 0x80000182);
  EXPECT_EQ(take<std::int32_t>(model.get(), "Ksint32"), -2147483262);
  EXPECT_EQ(take<std::uint64_t>(model.get(), "Kuint64"), 0x1FFFFFFF80000182u);
  EXPECT_EQ(take<std::int64_t>(model.get(), "Ksint64"), 0x1FFFFFFF80000182);
}

TEST_F(Keys, WideSignedKeysAreCutToTheirWidth) {
  NamedValues keys;
  for (const char* name : {"Kuint8", "Ksint8", "Kuint16", "Ksint16", "Kuint32", "Ksint32"})
    keys.set(name, Any::signedNumber(CMPI_sint64, -2));
  const Ref<Instance> model = read_keys(keys);
  EXPECT_EQ(take<std::uint8_t>(model.get(), "Kuint8"), 254);
  EXPECT_EQ(take<std::int8_t>(model.get(), "Ksint8"), -2);
  EXPECT_EQ(take<std::uint16_t>(model.get(), "Kuint16"), 65534);
  EXPECT_EQ(take<std::int16_t>(model.get(), "Ksint16"), -2);
  EXPECT_EQ(take<std::uint32_t>(model.get(), "Kuint32"), 4294967294u);
  EXPECT_EQ(take<std::int32_t>(model.get(), "Ksint32"), -2);
}

TEST_F(Keys, ANullWideKeyStaysNull) {
  CMPIObjectPath_Container container(
      repository(), face(), "root/test",
      objects.path({"", "root/test", "TEST_Keys", {{"Kuint16", Any::null(CMPI_uint64)}}}));
  Value value;
  ASSERT_EQ(container.get_value(0, UINT16, value), 0);
  EXPECT_EQ(value.type(), UINT16);
  EXPECT_TRUE(value.null());
}

TEST_F(Keys, OtherTypesAreNotConverted) {
  Trace_Log log;
  const Ref<Instance> model = read_keys({{"Kuint16", Any::number(CMPI_uint32, 1)},
                                         {"Kboolean", Any::number(CMPI_uint64, 1)},
                                         {"Kstring", Any::number(CMPI_uint64, 1)},
                                         {"Kuint32", Any::string("1")}});
  for (const char* name : {"Kuint16", "Kboolean", "Kstring", "Kuint32"})
    EXPECT_TRUE(null_in(model.get(), name)) << name;
  EXPECT_TRUE(log.has("WARN", "type mismatch on Kuint16: uint32/uint16"));
  EXPECT_TRUE(log.has("WARN", "type mismatch on Kboolean: uint64/boolean"));
  EXPECT_TRUE(log.has("WARN", "type mismatch on Kstring: uint64/string"));
  EXPECT_TRUE(log.has("WARN", "type mismatch on Kuint32: string/uint32"));
}

TEST_F(Keys, FeaturesThatAreNoKeysAreSkippedQuietly) {
  Trace_Log log;
  const Ref<Instance> model = read_keys({{"Note", Any::string("n")}});
  EXPECT_TRUE(null_in(model.get(), "Note"));
  EXPECT_THAT(log.texts("WARN"), ElementsAre());
}

TEST_F(Keys, ReferenceKeysAreReadWithTheirOwnKeys) {
  tvx::host::ObjectPath path = {"",
                                "root/test",
                                "TEST_Link",
                                {{"Antecedent", Any::reference(path_of("TEST_Spare", "s"))},
                                 {"Dependent", Any::reference(path_of("TEST_Part", "p"))}}};
  Instance* out = nullptr;
  ASSERT_EQ(make_cimrt_reference(nullptr, classes.link, objects.path(path), out), 0);
  const Ref<Instance> model(out);
  const auto* antecedent = take<Instance*>(model.get(), "Antecedent");
  ASSERT_NE(antecedent, nullptr);
  EXPECT_EQ(class_of(antecedent), classes.spare);
  EXPECT_EQ(take<String>(antecedent, "Id"), "s");
  CMPIObjectPath* back = nullptr;
  ASSERT_EQ(make_CMPI_object_path(face(), model.get(), "root/test", back), 0);
  EXPECT_TRUE(contents_of(back).sameObject(path));
}

}  // namespace
}  // namespace cimrt::test
