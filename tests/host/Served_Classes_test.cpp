// The built provider library under the broker: what any client can check of every class.
#include <dlfcn.h>
#include <gtest/gtest.h>

#include <cstdlib>
#include <filesystem>
#include <thread>

#include "Broker.h"
#include "schema/ClassData.h"

namespace tvx::host {
namespace {

namespace fs = std::filesystem;

const ClassCatalogue& classes() {
  static const ClassCatalogue catalogue(allClasses, allClassCount);
  return catalogue;
}

/// Paths of the provider lie below a folder of the test's own; the simulated libraries are in
/// memory before the provider asks the dynamic linker for them by name.
class Machine : public ::testing::Environment {
 public:
  void SetUp() override {
    std::string pattern = testing::TempDir() + "served-classes-XXXXXX";
    m_Root = mkdtemp(pattern.data());
    for (const char* folder : {"etc", "var/log", "opt/ibm/platform/log"}) {
      fs::create_directories(m_Root / folder);
    }
    setenv("TVX_ROOT", m_Root.c_str(), 1);
    for (const char* library : {SIMULATED_RM, SIMULATED_HBA}) {
      ASSERT_NE(dlopen(library, RTLD_NOW | RTLD_LOCAL), nullptr) << dlerror();
    }
  }
  void TearDown() override { fs::remove_all(m_Root); }

 private:
  fs::path m_Root;
};

const auto* const machine = testing::AddGlobalTestEnvironment(new Machine);

BrokerOptions strictOptions(int version = 200) {
  BrokerOptions options;
  options.strict = true;
  options.version = version;
  options.classes = &classes();
  return options;
}

class ServedClassesTest : public ::testing::TestWithParam<int> {
 protected:
  ServedClassesTest() : broker(strictOptions(GetParam())) { broker.load(PROVIDER_LIBRARY); }
  ~ServedClassesTest() override {
    EXPECT_TRUE(broker.unload(true).ok());
    EXPECT_EQ(broker.openAttachments(), 0U);
    EXPECT_TRUE(broker.lateNotes().empty());
    for (const ScopeReport& report : broker.threadReports()) {
      EXPECT_FALSE(report.leaks()) << report.text();
    }
  }

  Reply exact(Operation operation, const char* className) {
    Request request;
    request.operation = operation;
    request.path.className = className;
    request.path.nameSpace = classes().find(className)->nameSpace;
    request.exact = true;
    return broker.run(request);
  }

  static void expectClean(const Reply& reply, const std::string& what) {
    EXPECT_EQ(reply.status.rc, CMPI_RC_OK) << what << ": " << reply.status.message;
    EXPECT_FALSE(reply.report.leaks()) << what << "\n" << reply.report.text();
    EXPECT_TRUE(reply.report.complaints.empty()) << reply.report.text();
  }

  Broker broker;
};

TEST_P(ServedClassesTest, NamesAndInstancesAgreeAndEachNameIsFound) {
  std::size_t found = 0;
  for (const ClassData* each : classes().servedSubclasses("CIM_ManagedElement")) {
    const Reply names = exact(Operation::EnumerateInstanceNames, each->name);
    const Reply instances = exact(Operation::EnumerateInstances, each->name);
    expectClean(names, each->name);
    expectClean(instances, each->name);
    ASSERT_EQ(names.paths.size(), instances.instances.size()) << each->name;
    for (std::size_t i = 0; i < names.paths.size(); ++i) {
      EXPECT_EQ(names.paths[i], instances.instances[i].path);
      const Reply one = broker.getInstance(names.paths[i]);
      ASSERT_EQ(one.instances.size(), 1U) << printPath(names.paths[i]) << rcWords(one.status.rc);
      EXPECT_TRUE(one.instances[0].path.sameObject(names.paths[i])) << printPath(names.paths[i]);
      ++found;
    }
  }
  EXPECT_GT(found, 40U) << "the default scenario fills the adapter maps";
}

TEST_P(ServedClassesTest, AssociationsLeadFromEachEndToTheOther) {
  std::size_t walked = 0;
  for (const ClassData* each : classes().servedAssociations("")) {
    const Reply links = exact(Operation::EnumerateInstances, each->name);
    expectClean(links, each->name);
    for (const Instance& link : links.instances) {
      std::vector<ObjectPath> ends;
      for (const NamedValue& property : link.properties) {
        if (property.value.type() == CMPI_ref && !property.value.isNull()) {
          ends.push_back(property.value.asReference());
        }
      }
      ASSERT_GE(ends.size(), 2U) << printPath(link.path);
      if (ends[0].sameObject(ends[1])) {
        continue;
      }
      const Reply far = broker.associatorNames(ends[0], each->name);
      expectClean(far, each->name);
      EXPECT_TRUE(std::any_of(far.paths.begin(), far.paths.end(),
                              [&](const ObjectPath& path) { return path.sameObject(ends[1]); }))
          << each->name << " does not lead from " << printPath(ends[0]) << " to "
          << printPath(ends[1]);
      const Reply references = broker.referenceNames(ends[1], each->name);
      expectClean(references, each->name);
      EXPECT_FALSE(references.paths.empty()) << each->name << " from " << printPath(ends[1]);
      ++walked;
    }
  }
  EXPECT_GT(walked, 40U);
}

INSTANTIATE_TEST_SUITE_P(Versions, ServedClassesTest, ::testing::Values(0, 100, 200));

TEST(LibraryLifeTest, TheLibraryUnloadsAndLoadsAgainInOneProcess) {
  for (int round = 0; round < 3; ++round) {
    Broker broker(strictOptions());
    broker.load(PROVIDER_LIBRARY);
    EXPECT_EQ(broker.enumerateInstances("TVXHBA_FCPort").instances.size(), 4U) << round;
    EXPECT_TRUE(broker.unload(round == 1).ok());
    EXPECT_FALSE(broker.isLoaded());
    EXPECT_FALSE(broker.stillMapped(PROVIDER_LIBRARY)) << "something keeps the library in memory";
  }
}

TEST(LibraryLifeTest, AnUnloadWhileTheMapsAreBuiltWaitsForTheThread) {
  for (int round = 0; round < 3; ++round) {
    Broker broker(strictOptions());
    broker.load(PROVIDER_LIBRARY);
    std::thread reader([&] { broker.enumerateInstances("TVXHBA_Chip"); });
    reader.join();
    EXPECT_TRUE(broker.unload(true).ok());
    EXPECT_EQ(broker.openAttachments(), 0U);
  }
}

TEST(LibraryLifeTest, SeveralReadersGetTheSameAnswer) {
  Broker broker(strictOptions());
  broker.load(PROVIDER_LIBRARY);
  std::vector<std::thread> readers;
  std::atomic<unsigned> good{0};
  for (const char* name :
       {"TVXHBA_FCPort", "TVXHBA_PortController", "TVXHBA_FCPort", "TVXHBA_PhysicalConnector"}) {
    readers.emplace_back([&, name] {
      for (int i = 0; i < 20; ++i) {
        good += broker.enumerateInstances(name).instances.size() == 4 ? 1 : 0;
      }
    });
  }
  for (std::thread& reader : readers) {
    reader.join();
  }
  EXPECT_EQ(good.load(), 80U);
}

}  // namespace
}  // namespace tvx::host
