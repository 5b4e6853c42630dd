#include <gtest/gtest.h>

#include "Test_Classes.h"
#include "cim/ClassCatalogue.h"

namespace tvx::host {
namespace {

std::vector<std::string> names(const std::vector<const ClassData*>& classes) {
  std::vector<std::string> result;
  for (const ClassData* each : classes) {
    result.emplace_back(each->name);
  }
  return result;
}

using Names = std::vector<std::string>;

TEST(ClassCatalogueTest, FindsClassesInAnyCase) {
  ASSERT_NE(test::testClasses().find("fake_WIDGET"), nullptr);
  EXPECT_STREQ(test::testClasses().find("fake_WIDGET")->name, "FAKE_Widget");
  EXPECT_EQ(test::testClasses().find("FAKE_Widgets"), nullptr);
}

TEST(ClassCatalogueTest, SubclassTestWalksTheAncestors) {
  EXPECT_TRUE(test::testClasses().isA("FAKE_Gadget", "cim_thing"));
  EXPECT_TRUE(test::testClasses().isA("FAKE_Gadget", "FAKE_Gadget"));
  EXPECT_FALSE(test::testClasses().isA("FAKE_Widget", "FAKE_Gadget"));
  EXPECT_FALSE(test::testClasses().isA("Unknown", "CIM_Thing"));
}

TEST(ClassCatalogueTest, ServedClassesBelowABaseAreSorted) {
  EXPECT_EQ(names(test::testClasses().servedSubclasses("CIM_Thing")),
            (Names{"FAKE_Gadget", "FAKE_Widget"}));
  EXPECT_EQ(names(test::testClasses().servedSubclasses("FAKE_Foreign")), Names{});
  EXPECT_EQ(names(test::testClasses().servedAssociations("")), Names{"FAKE_Link"});
  EXPECT_EQ(names(test::testClasses().servedAssociations("FAKE_Widget")), Names{});
  EXPECT_EQ(test::testClasses().all().size(), 5U);
}

TEST(ClassCatalogueTest, NearNamesComeNearestFirst) {
  EXPECT_EQ(test::testClasses().nearNames("FAKE_Wigdet").front(), "FAKE_Widget");
  EXPECT_EQ(test::testClasses().nearNames("gadget").front(), "FAKE_Gadget")
      << "the prefix may be left out";
  EXPECT_TRUE(test::testClasses().nearNames("SomethingElseAltogether").empty());
  EXPECT_EQ(nearest("ab", {"abc", "ab", "abcd", "zzzzzz"}, 2), (Names{"ab", "abc"}));
}

TEST(ClassCatalogueTest, NamespacesAndFeaturesAreFoundInAnyCase) {
  EXPECT_TRUE(test::testClasses().knowsNameSpace("Root/FAKE"));
  EXPECT_FALSE(test::testClasses().knowsNameSpace("root/other"));
  const ClassData& widget = *test::testClasses().find("FAKE_Widget");
  EXPECT_STREQ(findFeature(widget, "color")->name, "Color");
  EXPECT_EQ(findFeature(widget, "Paint"), nullptr);
  ASSERT_NE(findMethod(widget, "PAINT"), nullptr);
  EXPECT_TRUE(findParameter(*findMethod(widget, "Paint"), "log")->isOut);
}

}  // namespace
}  // namespace tvx::host
