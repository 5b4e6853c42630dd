// A broker over the fake provider, for tests.
#pragma once

#include "Broker.h"
#include "Test_Classes.h"

namespace tvx::host::test {

inline BrokerOptions fakeOptions(bool strict = false, int version = 200) {
  BrokerOptions options;
  options.strict = strict;
  options.version = version;
  options.classes = &testClasses();
  options.nameSpace = "root/fake";
  return options;
}

/// The provider is loaded; index 0 to 2 name the widgets.
struct FakeBroker : Broker {
  explicit FakeBroker(bool strict = false, int version = 200)
      : Broker(fakeOptions(strict, version)) {
    load(FAKE_PROVIDER);
  }

  ObjectPath widget(unsigned index) {
    Request request;
    request.operation = Operation::EnumerateInstanceNames;
    request.path.className = "FAKE_Widget";
    request.path.nameSpace = "root/fake";
    request.exact = true;
    return run(request).paths.at(index);
  }

  /// Calls the method that breaks rules.
  Reply misbehave(const std::string& how) {
    return invokeMethod(widget(0), "Misbehave", {{"How", Value::string(how)}});
  }
};

}  // namespace tvx::host::test
