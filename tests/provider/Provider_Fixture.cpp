#include "Provider_Fixture.h"

#include <algorithm>
#include <cstdlib>
#include <fstream>

#include "tvxsim/tvxsim.h"

namespace tvx::test {

std::vector<std::string> servedClasses() {
  std::vector<std::string> names;
  for (std::size_t i = 0; i < host::allClassCount; i++)
    if (host::allClasses[i].isServed) names.emplace_back(host::allClasses[i].name);
  std::sort(names.begin(), names.end());
  return names;
}

void Provider_Test::SetUp() {
  std::string name = (std::filesystem::temp_directory_path() / "tvx_provider_XXXXXX").string();
  ASSERT_NE(mkdtemp(name.data()), nullptr);
  root = name;
  std::filesystem::create_directories(root / "etc");
  std::filesystem::create_directories(root / "opt/ibm/platform/log");
  setenv("TVX_ROOT", root.c_str(), 1);
  classes = std::make_unique<host::ClassCatalogue>(host::allClasses, host::allClassCount);
  useScenario();
}

void Provider_Test::TearDown() {
  if (broker) unload();
  std::filesystem::remove_all(root);
}

void Provider_Test::useScenario(const std::string& json) {
  const int result = json.empty() ? tvxsim_load(nullptr) : tvxsim_load_text(json.c_str());
  ASSERT_EQ(result, 0) << tvxsim_last_error();
}

void Provider_Test::addFault(const std::string& json) {
  ASSERT_EQ(tvxsim_add_fault(json.c_str()), 0) << tvxsim_last_error();
}

void Provider_Test::writeFile(const std::string& path, const std::string& text) {
  std::ofstream(root / path) << text;
}

host::Broker& Provider_Test::load(host::BrokerOptions options) {
  options.strict = true;
  options.classes = classes.get();
  broker = std::make_unique<host::Broker>(options);
  broker->load(TVX_PROVIDER_LIBRARY);
  return *broker;
}

void Provider_Test::unload() {
  EXPECT_EQ(broker->unload().rc, CMPI_RC_OK);
  EXPECT_EQ(broker->openAttachments(), 0u);
  EXPECT_TRUE(broker->lateNotes().empty());
  for (const host::ScopeReport& report : broker->threadReports())
    EXPECT_FALSE(report.leaks()) << report.text();
  broker.reset();
}

std::vector<host::Instance> Provider_Test::instances(const std::string& className,
                                                     const host::PropertyList& properties) {
  host::Reply reply = broker->enumerateInstances(className, properties);
  EXPECT_EQ(reply.status.rc, CMPI_RC_OK) << className << ": " << reply.status.message;
  EXPECT_FALSE(reply.report.leaks()) << className << "\n" << reply.report.text();
  EXPECT_TRUE(reply.report.complaints.empty()) << className;
  const auto kind = static_cast<std::size_t>(host::ObjectKind::Instance);
  EXPECT_EQ(reply.report.leftBehind[kind], 0u) << className << ": instances pile up";
  return std::move(reply.instances);
}

}  // namespace tvx::test
