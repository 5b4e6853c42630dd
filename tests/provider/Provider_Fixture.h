// The built provider library in a broker, on a simulated host with a root folder of its own.
#pragma once

#include <gtest/gtest.h>

#include <filesystem>
#include <memory>
#include <string>
#include <vector>

#include "Broker.h"
#include "schema/ClassData.h"

namespace tvx::test {

/// Names of the classes that the provider serves, sorted.
std::vector<std::string> servedClasses();

class Provider_Test : public ::testing::Test {
 protected:
  void SetUp() override;
  void TearDown() override;

  /// Makes the simulated host of a scenario text; the default scenario without one.
  void useScenario(const std::string& json = {});
  void addFault(const std::string& json);
  void writeFile(const std::string& path, const std::string& text);
  /// Opens the library in a fresh broker, which accounts for every object.
  host::Broker& load(host::BrokerOptions options = {});
  /// Unloads everything and checks what the broker counted.
  void unload();

  /// One request that must succeed and leave nothing behind.
  std::vector<host::Instance> instances(const std::string& className,
                                        const host::PropertyList& properties = {});

  std::filesystem::path root;
  std::unique_ptr<host::ClassCatalogue> classes;
  std::unique_ptr<host::Broker> broker;
};

}  // namespace tvx::test
