// What holds for every class, as a client sees it.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>

#include "Served_Program.h"
#include "Wbemcli.h"
#include "cim/ClassCatalogue.h"
#include "cmpi/cmpidt.h"

namespace tvx::host::test {
namespace {

/// So many instances of each class are looked at; the rest differs in values alone.
constexpr std::size_t perClass = 2;

class ClassesTest : public ::testing::Test {
 protected:
  static void SetUpTestSuite() {
    s_Server = new ServedProgram({TVXCIM, "--strict", "--sim"});
    ASSERT_NE(s_Server->port(), 0);
  }
  static void TearDownTestSuite() {
    EXPECT_EQ(s_Server->end(), 0) << "something leaked";
    delete s_Server;
    s_Server = nullptr;
  }

  static std::string url(const ClassData& classData) {
    return "http://" + s_Server->host() + "/" + classData.nameSpace + ":" + classData.name;
  }
  static std::vector<const ClassData*> served() {
    static const ClassCatalogue catalogue(allClasses, allClassCount);
    std::vector<const ClassData*> result = catalogue.all();
    std::erase_if(result, [](const ClassData* each) { return !each->isServed; });
    return result;
  }
  static std::vector<std::string> names(const ClassData& classData) {
    const WbemcliAnswer answer = wbemcli({"ein", url(classData)});
    EXPECT_EQ(answer.exitCode, 0) << classData.name << ": " << answer.text;
    return answer.lines;
  }
  static std::vector<std::string> first(std::vector<std::string> all) {
    all.resize(std::min(all.size(), perClass));
    return all;
  }

  static ServedProgram* s_Server;
};

ServedProgram* ClassesTest::s_Server = nullptr;

TEST_F(ClassesTest, GetAnswersWhatEnumerateAnswers) {
  const WbemcliTexts texts(s_Server->host());
  std::size_t compared = 0;
  for (const ClassData* each : served()) {
    const std::vector<std::string> all = names(*each);
    const WbemcliAnswer instances = wbemcli({"ei", url(*each)});
    ASSERT_EQ(instances.exitCode, 0) << each->name << ": " << instances.text;
    // Values may hold line ends, so that lines are looked for by name.
    for (const std::string& name : first(all)) {
      const auto line = std::find_if(
          instances.lines.begin(), instances.lines.end(),
          [&](const std::string& candidate) { return candidate.starts_with(name + " "); });
      ASSERT_NE(line, instances.lines.end()) << name;
      const WbemcliAnswer got = wbemcli({"gi", texts.asInput(name)});
      ASSERT_EQ(got.exitCode, 0) << name << ": " << got.text;
      const std::string own = texts.asInput(name).substr(7);
      EXPECT_EQ(texts.split(got.lines.at(0), {own}).properties,
                texts.split(*line, {name}).properties)
          << name;
      ++compared;
    }
  }
  EXPECT_GT(compared, 100u);
}

TEST_F(ClassesTest, EveryClassIsDescribed) {
  for (const ClassData* each : served()) {
    const WbemcliAnswer answer = wbemcli({"gc", "-t", url(*each)});
    EXPECT_EQ(answer.exitCode, 0) << answer.text;
    for (const FeatureData& feature : features(*each)) {
      if (feature.isKey) {
        EXPECT_THAT(answer.text, ::testing::HasSubstr(std::string(feature.name) +
                                                      (feature.cmpiType == CMPI_ref ? "&#" : "#")))
            << each->name;
      }
    }
  }
}

TEST_F(ClassesTest, EveryReferenceOfAnInstanceResolves) {
  const WbemcliTexts texts(s_Server->host());
  std::size_t resolved = 0;
  for (const ClassData* each : served()) {
    if (each->isAssociation) {
      continue;
    }
    std::vector<std::string> some = first(names(*each));
    some.resize(std::min<std::size_t>(some.size(), 1));
    for (const std::string& name : some) {
      const WbemcliAnswer links = wbemcli({"rin", texts.asInput(name)});
      ASSERT_EQ(links.exitCode, 0) << name << ": " << links.text;
      for (const std::string& link : links.lines) {
        const WbemcliAnswer got = wbemcli({"gi", texts.asInput(link)});
        EXPECT_EQ(got.exitCode, 0) << link << ": " << got.text;
        ++resolved;
      }
    }
  }
  EXPECT_GT(resolved, 100u);
}

/// Ends of classes that the server's own providers have are not served here.
bool isServedEnd(const WbemcliTexts& texts, const End& end) {
  return texts.className(end.path).starts_with("TVXHBA_");
}

TEST_F(ClassesTest, AssociatedNamesLeadToTheOtherEndAndBack) {
  const WbemcliTexts texts(s_Server->host());
  std::size_t walked = 0;
  for (const ClassData* each : served()) {
    if (!each->isAssociation) {
      continue;
    }
    for (const std::string& name : first(names(*each))) {
      const std::vector<End> ends = texts.ends(name);
      ASSERT_GE(ends.size(), 2u) << name;
      for (const End& from : ends) {
        if (isServedEnd(texts, from)) {
          EXPECT_EQ(wbemcli({"gi", texts.asInput(from.path)}).exitCode, 0) << from.path;
        }
        const WbemcliAnswer found =
            wbemcli({"ain", "-ac", each->name, "-ar", from.role, texts.asInput(from.path)});
        EXPECT_EQ(found.exitCode, 0) << from.path << ": " << found.text;
        for (const End& to : ends) {
          if (to.role != from.role) {
            EXPECT_THAT(found.lines, ::testing::Contains(to.path))
                << each->name << " from " << from.path;
            ++walked;
          }
        }
      }
    }
  }
  EXPECT_GT(walked, 100u);
}

}  // namespace
}  // namespace tvx::host::test
