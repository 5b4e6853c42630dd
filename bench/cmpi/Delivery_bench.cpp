// Cost of delivering one instance to the server, for a small and a large class, split into shares:
//   clone    the copy that a provider makes of its map's entry
//   convert  the walk from the instance to the server's functions, which do nothing here
//   broker   the same calls on the broker of the host programs, without any conversion
//   deliver  clone, convert and broker together, as for each instance of an enumeration
// The argument is the number of properties, half of them texts and half of them numbers.
#include <benchmark/benchmark.h>

#include <string>

#include "Test_Classes.h"
#include "Test_Instances.h"
#include "Test_Server.h"
#include "cmpi/CMPI_Object.h"
#include "cmpi/Converter.h"

namespace cimrt::test {
namespace {

std::string property_name(int i) {
  return (i % 2 == 0 ? "Text" : "Number") + std::to_string(i);
}

/// A class with a key and `count - 1` further properties.
const Meta_Class* class_of_size(int count) {
  Record_Builder builder;
  builder.property("Id", STRING, FLAG_KEY);
  for (int i = 1; i < count; ++i)
    builder.property(property_name(i).c_str(), i % 2 == 0 ? STRING : UINT32);
  return builder.build_class("TEST_Sized");
}

Ref<Instance> filled(const Meta_Class* meta_class) {
  Ref<Instance> instance = make_element(meta_class, "50:01:43:80:12:34:56:78");
  for (std::uint64_t i = 1; i < meta_class->num_meta_features; ++i) {
    const char* name = meta_class->meta_features[i]->name;
    if (i % 2 == 0)
      put(instance, name, "a text of the usual length");
    else
      put(instance, name, static_cast<std::uint32_t>(i));
  }
  return instance;
}

/// A server whose objects keep nothing.
class Null_Server {
 public:
  Null_Server() {
    _string_table.release = [](CMPIString*) { return CMPIStatus{CMPI_RC_OK, nullptr}; };
    _path_table.release = [](CMPIObjectPath*) { return CMPIStatus{CMPI_RC_OK, nullptr}; };
    _path_table.addKey = [](CMPIObjectPath*, const char*, const CMPIValue*, CMPIType) {
      return CMPIStatus{CMPI_RC_OK, nullptr};
    };
    _instance_table.release = [](CMPIInstance*) { return CMPIStatus{CMPI_RC_OK, nullptr}; };
    _instance_table.setProperty = [](const CMPIInstance*, const char*, const CMPIValue*, CMPIType) {
      return CMPIStatus{CMPI_RC_OK, nullptr};
    };
    _makers.newString = [](const CMPIBroker*, const char*, CMPIStatus*) { return &_string; };
    _makers.newObjectPath = [](const CMPIBroker*, const char*, const char*, CMPIStatus*) {
      return &_path;
    };
    _makers.newInstance = [](const CMPIBroker*, const CMPIObjectPath*, CMPIStatus*) {
      return &_instance;
    };
  }
  const CMPIBroker* face() const { return &_face; }

 private:
  static inline CMPIStringFT _string_table{};
  static inline CMPIObjectPathFT _path_table{};
  static inline CMPIInstanceFT _instance_table{};
  static inline CMPIString _string = {nullptr, &_string_table};
  static inline CMPIObjectPath _path = {nullptr, &_path_table};
  static inline CMPIInstance _instance = {nullptr, &_instance_table};
  CMPIBrokerEncFT _makers{};
  CMPIBroker _face = {nullptr, nullptr, &_makers, nullptr, nullptr};
};

/// Converts an instance and gives the result back.
void convert(benchmark::State& state, const CMPIBroker* broker, const Instance* instance) {
  CMPI_Ptr<CMPIObjectPath> path;
  CMPI_Ptr<CMPIInstance> made;
  if (make_CMPI_object_path(broker, instance, "root/test", path.receive()) != 0 ||
      make_CMPI_instance(broker, instance, "root/test", path.get(), nullptr, made.receive()) != 0)
    state.SkipWithError("conversion failed");
}

void clone_share(benchmark::State& state) {
  const Ref<Instance> instance = filled(class_of_size(static_cast<int>(state.range(0))));
  for (auto _ : state) benchmark::DoNotOptimize(Ref<Instance>(clone(instance.get())));
}

void convert_share(benchmark::State& state) {
  const Null_Server server;
  const Ref<Instance> instance = filled(class_of_size(static_cast<int>(state.range(0))));
  for (auto _ : state) convert(state, server.face(), instance.get());
}

/// The server's objects for the same instance, made straight from constants.
void make_by_hand(const CMPIBroker* broker, const std::vector<std::string>& names) {
  const CMPI_Ptr<CMPIObjectPath> path(CMNewObjectPath(broker, "root/test", "TEST_Sized", nullptr));
  const auto set_text = [&](auto&& set) {
    CMPI_Ptr<CMPIString> text(CMNewString(broker, "a text of the usual length", nullptr));
    CMPIValue value = {};
    value.string = text.get();
    set(value, CMPI_string);
  };
  set_text([&](const CMPIValue& v, CMPIType t) { CMAddKey(path.get(), "Id", &v, t); });
  const CMPI_Ptr<CMPIInstance> made(CMNewInstance(broker, path.get(), nullptr));
  for (std::size_t i = 0; i < names.size(); ++i) {
    const auto set = [&](const CMPIValue& v, CMPIType t) {
      CMSetProperty(made.get(), names[i].c_str(), &v, t);
    };
    CMPIValue number = {};
    number.uint32 = static_cast<CMPIUint32>(i);
    if (i % 2 == 0)
      set_text(set);
    else
      set(number, CMPI_uint32);
  }
}

/// The broker of the host programs, not strict, as a server would be.
struct Plain_Broker {
  tvx::host::Broker broker;
  tvx::host::Core& core = tvx::host::Core::of(broker.face());
  tvx::host::Scope scope{core, "bench"};
  tvx::host::ScopeGuard guard{scope};
};

void broker_share(benchmark::State& state) {
  Plain_Broker server;
  std::vector<std::string> names = {"Id"};
  for (int i = 1; i < state.range(0); ++i) names.push_back(property_name(i));
  for (auto _ : state) make_by_hand(server.broker.face(), names);
}

void deliver(benchmark::State& state) {
  Plain_Broker server;
  const Ref<Instance> instance = filled(class_of_size(static_cast<int>(state.range(0))));
  for (auto _ : state) {
    const Ref<Instance> copy(clone(instance.get()));
    convert(state, server.broker.face(), copy.get());
  }
}

BENCHMARK(clone_share)->Arg(10)->Arg(70);
BENCHMARK(convert_share)->Arg(10)->Arg(70);
BENCHMARK(broker_share)->Arg(10)->Arg(70);
BENCHMARK(deliver)->Arg(10)->Arg(70);

}  // namespace
}  // namespace cimrt::test
