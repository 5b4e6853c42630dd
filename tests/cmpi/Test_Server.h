// A server in the program with scripted providers, for whole requests.
#pragma once

#include <gtest/gtest.h>

#include <memory>
#include <optional>

#include "Broker.h"
#include "Scripted_Provider.h"
#include "Test_Classes.h"
#include "broker/Objects.h"
#include "broker/Scope.h"

namespace cimrt::test {

/// One class that the program serves: its static data, registration and factories.
template <int N>
struct Slot {
  static inline CMPI_Static_Data data;
  static inline Scripted_Registration registration;

  static void* make(const CMPIBroker* broker, const CMPIContext* context, char letter) {
    void* result = nullptr;
    cimrt_cmpi_adapter('C', &data, &registration, broker, context, registration.provider_name,
                       letter, &result);
    return result;
  }
  static CMPIInstanceMI* instance(const CMPIBroker* broker, const CMPIContext* context,
                                  CMPIStatus*) {
    return static_cast<CMPIInstanceMI*>(make(broker, context, 'I'));
  }
  static CMPIAssociationMI* association(const CMPIBroker* broker, const CMPIContext* context,
                                        CMPIStatus*) {
    return static_cast<CMPIAssociationMI*>(make(broker, context, 'A'));
  }
  static CMPIMethodMI* method(const CMPIBroker* broker, const CMPIContext* context, CMPIStatus*) {
    return static_cast<CMPIMethodMI*>(make(broker, context, 'M'));
  }
};

/// A strict server: every object is accounted for, and a double release aborts.
class Test_Server {
 public:
  explicit Test_Server(int version = 200) : broker(options(version)) {}

  /// Serves the class of `meta_class` (or requests for `name`) by the script.
  template <int N>
  void serve(Script& script, const Meta_Class* meta_class, const char* name = nullptr) {
    script.meta_class = meta_class;
    Slot<N>::registration.module_name = "test";
    Slot<N>::registration.provider_name = "TEST_Provider";
    Slot<N>::registration.provider_proc = &scripted_proc;
    Slot<N>::registration.meta_class = meta_class;
    Slot<N>::registration.next = nullptr;
    Slot<N>::registration.script = &script;
    add<N>(name ? name : meta_class->name);
  }
  /// Sends requests for another class name to the same adapter.
  template <int N>
  void add(const char* name) {
    broker.addProvider(name, {&Slot<N>::instance, &Slot<N>::association, &Slot<N>::method});
  }

  tvx::host::Core& core() { return tvx::host::Core::of(broker.face()); }

  tvx::host::Broker broker;

 private:
  static tvx::host::BrokerOptions options(int version) {
    tvx::host::BrokerOptions options;
    options.version = version;
    options.strict = true;
    options.nameSpace = "root/test";
    return options;
  }
};

/// Owner of CMPI objects that a test makes by itself, as a request would own them.
class Request_Objects {
 public:
  explicit Request_Objects(Test_Server& server)
      : core(server.core()),
        scope(core, "test"),
        guard(scope),
        context(tvx::host::makeContext(core, {}, tvx::host::Origin::HandedOut)) {}

  CMPIObjectPath* path(const tvx::host::ObjectPath& contents) {
    return tvx::host::makePath(core, contents, tvx::host::Origin::HandedOut);
  }
  CMPIInstance* instance(const tvx::host::Instance& contents) {
    return tvx::host::makeInstance(core, contents, tvx::host::Origin::HandedOut);
  }
  CMPIArgs* args(const tvx::host::NamedValues& contents) {
    return tvx::host::makeArgs(core, contents, tvx::host::Origin::HandedOut);
  }

  tvx::host::Core& core;
  tvx::host::Scope scope;
  tvx::host::ScopeGuard guard;
  CMPIContext* context;
};

/// A path in the test namespace with one string key.
inline tvx::host::ObjectPath path_of(const char* class_name, const char* id,
                                     const char* key = "Id") {
  return {"", "root/test", class_name, {{key, tvx::host::Value::string(id)}}};
}

/// The contents behind a CMPI object that the server made.
inline const tvx::host::Instance& contents_of(const CMPIInstance* face) {
  return tvx::host::InstanceObject::from(face, "test")->contents.instance;
}
inline const tvx::host::ObjectPath& contents_of(const CMPIObjectPath* face) {
  return tvx::host::PathObject::from(face, "test")->contents;
}
inline const tvx::host::NamedValues& contents_of(const CMPIArgs* face) {
  return tvx::host::ArgsObject::from(face, "test")->contents;
}

}  // namespace cimrt::test
