// What holds for every class, as a client sees it.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>

#include "Filled_Host.h"
#include "Wbemcli.h"
#include "cim/ClassCatalogue.h"
#include "cmpi/cmpidt.h"

namespace tvx::host::test {
namespace {

/// So many instances of each class are looked at; the rest differs in values alone.
constexpr std::size_t perClass = 2;

class ClassesTest : public ::testing::Test {
 protected:
  static void SetUpTestSuite() { s_Host = new FilledHost; }
  static void TearDownTestSuite() {
    EXPECT_EQ(s_Host->end(), 0) << "something leaked";
    delete s_Host;
    s_Host = nullptr;
  }

  static std::string url(const ClassData& classData) {
    return "http://" + s_Host->host() + "/" + classData.nameSpace + ":" + classData.name;
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
  static std::vector<std::string> first(std::vector<std::string> all,
                                        std::size_t count = perClass) {
    all.resize(std::min(all.size(), count));
    return all;
  }
  /// What is printed of each instance. Values may hold line ends.
  static std::vector<std::string> instances(const WbemcliAnswer& answer) {
    std::vector<std::string> result;
    for (const std::string& line : answer.lines) {
      if (line.starts_with(s_Host->host() + "/")) {
        result.push_back(line);
      } else if (!result.empty()) {
        result.back() += "\n" + line;
      }
    }
    return result;
  }

  /// What is printed behind its name of the instance that `gi` answers.
  static std::string got(const WbemcliTexts& texts, const std::string& name) {
    const std::string input = texts.asInput(name);
    const WbemcliAnswer answer = wbemcli({"gi", input});
    EXPECT_EQ(answer.exitCode, 0) << name << ": " << answer.text;
    const std::vector<std::string> one = instances(answer);
    const std::string asked = input.substr(std::string("http://").size());
    if (one.size() != 1 || !one[0].starts_with(asked + " ")) {
      ADD_FAILURE() << "not one instance of the name asked for: " << answer.text;
      return {};
    }
    return one[0].substr(asked.size());
  }

  static FilledHost* s_Host;
};

FilledHost* ClassesTest::s_Host = nullptr;

TEST_F(ClassesTest, EveryClassHasInstancesButThoseThatNeverHave) {
  std::vector<std::string> empty;
  for (const ClassData* each : served()) {
    if (names(*each).empty()) {
      empty.push_back(each->name);
    }
  }
  EXPECT_EQ(served().size(), 152u);
  EXPECT_THAT(empty, ::testing::UnorderedElementsAre("TVXHBA_FCRealizes", "TVXHBA_VMSystemDevice"));
}

TEST_F(ClassesTest, GetAnswersWhatEnumerateAnswers) {
  const WbemcliTexts texts(s_Host->host());
  for (const ClassData* each : served()) {
    const std::vector<std::string> all = names(*each);
    const WbemcliAnswer answer = wbemcli({"ei", url(*each)});
    ASSERT_EQ(answer.exitCode, 0) << each->name << ": " << answer.text;
    const std::vector<std::string> enumerated = instances(answer);
    ASSERT_EQ(enumerated.size(), all.size()) << each->name;
    for (std::size_t i = 0; i < all.size(); ++i) {
      ASSERT_TRUE(enumerated[i].starts_with(all[i] + " ")) << all[i] << "\n" << enumerated[i];
    }
    for (std::size_t i = 0; i < std::min(all.size(), perClass); ++i) {
      std::string gotten = got(texts, all[i]);
      std::string listed = enumerated[i].substr(all[i].size());
      if (gotten != listed) {
        // Counters may have been read anew between the two; they are not within ten seconds again.
        listed = instances(wbemcli({"ei", url(*each)})).at(i).substr(all[i].size());
        gotten = got(texts, all[i]);
      }
      EXPECT_EQ(gotten, listed) << all[i];
    }
  }
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
  const WbemcliTexts texts(s_Host->host());
  std::vector<std::string> alone;
  for (const ClassData* each : served()) {
    if (each->isAssociation) {
      continue;
    }
    for (const std::string& name : first(names(*each), 1)) {
      const WbemcliAnswer links = wbemcli({"rin", texts.asInput(name)});
      ASSERT_EQ(links.exitCode, 0) << name << ": " << links.text;
      for (const std::string& link : links.lines) {
        const std::vector<End> ends = texts.ends(link);
        EXPECT_TRUE(
            std::any_of(ends.begin(), ends.end(), [&](const End& end) { return end.path == name; }))
            << link << " is no reference to " << name;
        const WbemcliAnswer got = wbemcli({"gi", texts.asInput(link)});
        EXPECT_EQ(got.exitCode, 0) << link << ": " << got.text;
      }
      if (links.lines.empty()) {
        alone.push_back(each->name);
      }
    }
  }
  EXPECT_THAT(alone, ::testing::UnorderedElementsAre("TVXHBA_EnabledRecordLogCapabilities",
                                                     "TVXHBA_ProviderConfigSetting"))
      << "no association has these at an end";
}

/// Ends of classes that the server's own providers have are not served here.
bool isServedEnd(const WbemcliTexts& texts, const End& end) {
  return texts.className(end.path).starts_with("TVXHBA_");
}

TEST_F(ClassesTest, AssociatedNamesLeadToTheOtherEndAndBack) {
  const WbemcliTexts texts(s_Host->host());
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
