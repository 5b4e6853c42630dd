// The built library in a broker: what every class answers to every operation, with the simulated
// adapters when they can be found and without any library when they cannot.
#include <gtest/gtest.h>

#include <algorithm>
#include <cstdlib>
#include <string>
#include <vector>

#include "Broker.h"
#include "cmpi/cmpidt.h"
#include "schema/ClassData.h"
#include "schema/catalogue.h"
#include "support/Temp_Root.h"

namespace cimrt::test {
namespace {

using namespace tvx::host;

/// True if the program was started with the folder of the simulated libraries.
bool simulated() {
  return std::getenv("LD_LIBRARY_PATH") != nullptr;
}

class Served_Classes : public testing::Test {
 protected:
  Served_Classes() : _classes(allClasses, allClassCount), _broker(options()) {
    _broker.load(TVX_MODULE);
  }

  Broker& broker() { return _broker; }
  const ClassData& data(const char* name) const { return *_classes.find(name); }

  /// An instance that the class serves, or a path with its plain keys filled in.
  ObjectPath some_path(const char* name) {
    const Reply names = _broker.enumerateInstanceNames(name);
    if (!names.paths.empty()) return names.paths.front();
    ObjectPath path{{}, "root/torvex", name, {}};
    for (const FeatureData& feature : features(data(name))) {
      if (feature.isKey && feature.cmpiType == CMPI_string) {
        path.keys.set(feature.name, Value::string("nothing"));
      }
    }
    return path;
  }

  /// How many of the objects the broker can fetch; the host and its chassis are other providers'.
  std::size_t fetchable(const std::vector<ObjectPath>& paths) {
    return static_cast<std::size_t>(std::ranges::count_if(
        paths, [&](const ObjectPath& path) { return data(path.className.c_str()).isServed; }));
  }

  static void expect(const Reply& reply, int rc, const char* operation) {
    EXPECT_EQ(reply.status.rc, rc) << operation << ": " << reply.status.message;
    EXPECT_FALSE(reply.report.leaks()) << operation << ": " << reply.report.text();
  }

 private:
  BrokerOptions options() const {
    BrokerOptions options;
    options.classes = &_classes;
    options.strict = true;
    return options;
  }

  tvx::test::Temp_Root _root;
  ClassCatalogue _classes;
  Broker _broker;
};

TEST_F(Served_Classes, AllAnswerTheirReads) {
  std::size_t served = 0;
  for (const Catalogue_Row& row : catalogue) {
    SCOPED_TRACE(row.name);
    const Reply names = broker().enumerateInstanceNames(row.name);
    expect(names, CMPI_RC_OK, "enumerateInstanceNames");
    const Reply instances = broker().enumerateInstances(row.name);
    expect(instances, CMPI_RC_OK, "enumerateInstances");
    EXPECT_TRUE(names.done && instances.done);
    EXPECT_EQ(names.paths.size(), instances.instances.size());
    served += !names.paths.empty();
    if (names.paths.empty()) continue;
    const Reply one = broker().getInstance(names.paths.back());
    expect(one, CMPI_RC_OK, "getInstance");
    if (one.instances.size() != 1) continue;
    EXPECT_TRUE(one.instances.front().path.sameObject(names.paths.back()));
  }
  if (simulated()) {
    EXPECT_GT(served, 50u);
  } else {
    EXPECT_EQ(served, 0u);
  }
}

TEST_F(Served_Classes, AnInstanceThatIsNotThereIsNotFound) {
  for (const Catalogue_Row& row : catalogue) {
    if (row.is_association()) continue;
    SCOPED_TRACE(row.name);
    ObjectPath path{{}, "root/torvex", row.name, {}};
    for (const FeatureData& feature : features(data(row.name))) {
      if (feature.isKey) path.keys.set(feature.name, Value::string("nothing"));
    }
    expect(broker().getInstance(path), CMPI_RC_ERR_NOT_FOUND, "getInstance");
  }
}

TEST_F(Served_Classes, ASkeletonSupportsNoChange) {
  for (const Catalogue_Row& row : catalogue) {
    if (row.provider != 'S') continue;
    SCOPED_TRACE(row.name);
    const Instance instance{some_path(row.name), {}};
    expect(broker().createInstance(instance), CMPI_RC_ERR_NOT_SUPPORTED, "createInstance");
    expect(broker().modifyInstance(instance), CMPI_RC_ERR_NOT_SUPPORTED, "modifyInstance");
    expect(broker().deleteInstance(instance.path), CMPI_RC_ERR_NOT_SUPPORTED, "deleteInstance");
  }
}

TEST_F(Served_Classes, NoneSupportsQueries) {
  for (const Catalogue_Row& row : catalogue) {
    SCOPED_TRACE(row.name);
    const std::string query = std::string("SELECT * FROM ") + row.name;
    expect(broker().execQuery(row.name, query, "WQL"), CMPI_RC_ERR_NOT_SUPPORTED, "execQuery");
  }
}

TEST_F(Served_Classes, ASkeletonSupportsNoneOfItsMethods) {
  std::size_t methods_called = 0;
  for (const Catalogue_Row& row : catalogue) {
    if (row.provider != 'S' || row.methods == 0) continue;
    const ObjectPath path = some_path(row.name);
    for (const MethodData& method : methods(data(row.name))) {
      SCOPED_TRACE(std::string(row.name) + "." + method.name);
      expect(broker().invokeMethod(path, method.name), CMPI_RC_ERR_NOT_SUPPORTED, "invokeMethod");
      ++methods_called;
    }
  }
  EXPECT_GT(methods_called, 80u);
}

TEST_F(Served_Classes, AnUnknownMethodIsNotFound) {
  for (const Catalogue_Row& row : catalogue) {
    SCOPED_TRACE(row.name);
    expect(broker().invokeMethod(some_path(row.name), "Levitate"), CMPI_RC_ERR_METHOD_NOT_FOUND,
           "invokeMethod");
  }
}

/// Asks one association class, and no other, about an object at one of its ends.
Request ask(Operation operation, const ObjectPath& source, const char* association) {
  Request request;
  request.operation = operation;
  request.path = source;
  request.exact = true;
  (operation == Operation::References || operation == Operation::ReferenceNames
       ? request.resultClass
       : request.assocClass) = association;
  return request;
}

TEST_F(Served_Classes, AnAssociationIsFoundFromBothOfItsEnds) {
  std::size_t walked = 0;
  for (const Catalogue_Row& row : catalogue) {
    if (!row.is_association()) continue;
    SCOPED_TRACE(row.name);
    const Reply names = broker().enumerateInstanceNames(row.name);
    if (names.paths.empty()) continue;
    const ObjectPath& association = names.paths.front();
    for (const NamedValue& end : association.keys) {
      SCOPED_TRACE(end.name);
      const ObjectPath& source = end.value.asReference();
      const Reply references = broker().run(ask(Operation::ReferenceNames, source, row.name));
      expect(references, CMPI_RC_OK, "referenceNames");
      EXPECT_TRUE(std::ranges::any_of(
          references.paths, [&](const ObjectPath& path) { return path.sameObject(association); }));
      const Reply full = broker().run(ask(Operation::References, source, row.name));
      expect(full, CMPI_RC_OK, "references");
      EXPECT_EQ(full.instances.size(), references.paths.size());
      const Reply others = broker().run(ask(Operation::AssociatorNames, source, row.name));
      expect(others, CMPI_RC_OK, "associatorNames");
      EXPECT_GE(others.paths.size(), 1u);
      const Reply ends = broker().run(ask(Operation::Associators, source, row.name));
      expect(ends, CMPI_RC_OK, "associators");
      EXPECT_EQ(ends.instances.size(), fetchable(others.paths));
      ++walked;
    }
  }
  EXPECT_EQ(walked > 60, simulated());
}

TEST_F(Served_Classes, EveryFactoryMakesAnInterface) {
  for (const Catalogue_Row& row : catalogue) {
    SCOPED_TRACE(row.name);
    EXPECT_NE(broker().interface(row.name, InterfaceKind::Instance), nullptr);
    EXPECT_NE(broker().interface(row.name, InterfaceKind::Method), nullptr);
    EXPECT_EQ(broker().interface(row.name, InterfaceKind::Association) != nullptr,
              row.is_association());
  }
}

TEST_F(Served_Classes, CanBeUnloadedAndLoadedAgain) {
  for (int i = 0; i < 2; ++i) {
    for (const Catalogue_Row& row : catalogue) {
      EXPECT_EQ(broker().enumerateInstanceNames(row.name).status.rc, CMPI_RC_OK) << row.name;
    }
    EXPECT_TRUE(broker().unload().ok());
    EXPECT_FALSE(broker().isLoaded());
    broker().load(TVX_MODULE);
  }
}

}  // namespace
}  // namespace cimrt::test
