// Computer system and chassis of the platform, as other providers of the same server hold them.
#include <string>
#include <vector>

#include "Map_Test.h"
#include "runtime/Thread_Context.h"

namespace cimrt::test {
namespace {

/// A server that answers enumerations out of a list, and nothing else.
class Platform_Context : public Thread_Context {
 public:
  ~Platform_Context() override {
    for (Instance* instance : instances) unref(instance);
  }
  Thread_Context* thread_create_hook(void*) override { return nullptr; }
  void thread_start_hook() override {}
  void thread_exit_hook() override {}
  void* instance_enumerator_create(const char* name_space, const Instance* model) override {
    asked.push_back(std::string(name_space) + ":" + class_of(model)->name);
    return instances.empty() ? nullptr : new std::size_t(0);
  }
  void instance_enumerator_destroy(void* enumerator) override {
    delete static_cast<std::size_t*>(enumerator);
  }
  bool instance_enumerator_more(void* enumerator) override {
    return *static_cast<std::size_t*>(enumerator) < instances.size();
  }
  void instance_enumerator_next(void* enumerator) override {
    ++*static_cast<std::size_t*>(enumerator);
  }
  Ref<Instance> instance_enumerator_get(void* enumerator) override {
    Instance* instance = instances.at(*static_cast<std::size_t*>(enumerator));
    ref(instance);
    return Ref<Instance>(instance);
  }
  Ref<Instance> get_instance(const char*, const Instance*) override { return {}; }
  int create_instance(const char*, const Instance*) override { return -1; }
  int delete_instance(const char*, const Instance*) override { return -1; }
  int modify_instance(const char*, const Instance*) override { return -1; }
  int invoke_method(const char*, const Instance*, Instance*) override { return -1; }
  void allow_unload(bool) override {}
  bool get_username(String&) override { return false; }

  std::vector<Instance*> instances;
  std::vector<std::string> asked;
};

class Platform : public Adapter_Maps {
 protected:
  void TearDown() override {
    if (Thread_Context::top()) Thread_Context::pop();
    Adapter_Maps::TearDown();
  }

  void addSystem(const char* name) {
    auto* system =
        static_cast<IBMSD_ComputerSystem*>(create(&IBMSD_ComputerSystem::static_meta_class, true));
    system->Name.set(name);
    system->CreationClassName.set("IBMSD_ComputerSystem");
    server.instances.push_back(system);
  }
  void addChassis(const char* tag) {
    auto* chassis = static_cast<IBMSD_Chassis*>(create(&IBMSD_Chassis::static_meta_class, true));
    chassis->Tag.set(tag);
    chassis->CreationClassName.set("IBMSD_Chassis");
    server.instances.push_back(chassis);
  }
  /// Builds the maps on this thread, with the platform's server behind it.
  ProviderAgent& buildHere() {
    ProviderAgent& agent = build();
    log.clear();
    Thread_Context::push(&server);
    Ranked_Lock maps(agent.m_AdapterMapsReadyMutex);
    Ranked_Lock data(agent.m_DataMutex);
    agent.m_bOwnComputerSystem = false;
    result = agent.updateAdapterMaps();
    return agent;
  }

  Platform_Context server;
  std::int32_t result = -1;
};

TEST_F(Platform, ComputerSystemOfThePlatformIsTakenOver) {
  addSystem("vios1");
  addSystem("vios2");
  ProviderAgent& agent = buildHere();
  EXPECT_EQ(result, 0);
  ASSERT_EQ(agent.m_CIM_ComputerSystem_map.size(), 1u);
  const CIM_ComputerSystem& system = *agent.m_CIM_ComputerSystem_map[0];
  EXPECT_EQ(text(system.Name), "vios1");
  EXPECT_TRUE(system.__name_space == "root/ibmse");
  EXPECT_FALSE(agent.m_bOwnComputerSystem);
  EXPECT_EQ(text(agent.m_TVXHBA_FCPort_map[0]->SystemName), "vios1");
  EXPECT_EQ(text(agent.m_TVXHBA_FCPort_map[0]->SystemCreationClassName), "IBMSD_ComputerSystem");
  ASSERT_GE(server.asked.size(), 2u);
  EXPECT_EQ(server.asked[0], "root/ibmse:IBMSD_ComputerSystem");
  EXPECT_EQ(server.asked[1], "root/ibmse:IBMSD_Chassis");
  EXPECT_EQ(log.count("up-call method failed"), 0u);
}

TEST_F(Platform, ComputerSystemOfThePlatformConformsToNothing) {
  addSystem("vios1");
  ProviderAgent& agent = buildHere();
  EXPECT_EQ(agent.m_TVXHBA_ComputerSystemConformsToProfile_map.size(), 0u);
  // Twelve base profiles, and that of the record log.
  EXPECT_EQ(log.count("This is IBM/VMWare comp Sys - do nothing"), 13u);
  EXPECT_EQ(agent.m_TVXHBA_FCPortConformsToProfile_map.size(), 16u);
}

TEST_F(Platform, SystemThatWasGeneratedOnceLetsAllLaterOnesConform) {
  ProviderAgent& agent = buildHere();
  ASSERT_TRUE(agent.m_bOwnComputerSystem);
  // The platform's provider comes up after the first refresh.
  addSystem("vios1");
  log.clear();
  Ranked_Lock maps(agent.m_AdapterMapsReadyMutex);
  Ranked_Lock data(agent.m_DataMutex);
  EXPECT_EQ(agent.updateAdapterMaps(), 0);
  EXPECT_EQ(text(agent.m_CIM_ComputerSystem_map[0]->Name), "vios1");
  EXPECT_TRUE(agent.m_bOwnComputerSystem);
  ASSERT_EQ(agent.m_TVXHBA_ComputerSystemConformsToProfile_map.size(), 13u);
  EXPECT_TRUE(ties(*agent.m_TVXHBA_ComputerSystemConformsToProfile_map[0],
                   agent.m_TVXHBA_RegisteredProfile_map[0], agent.m_CIM_ComputerSystem_map[0]));
  EXPECT_EQ(log.count("This is IBM/VMWare comp Sys - do nothing"), 0u);
}

TEST_F(Platform, ChassisOfThePlatformHoldsTheCardsAndGoesIntoNoMap) {
  addSystem("vios1");
  addChassis("frame 7");
  ProviderAgent& agent = buildHere();
  EXPECT_EQ(log.count("up-call - found the correct CIM_Chassis to link"), 1u);
  EXPECT_EQ(agent.m_CIM_Chassis_map.size(), 0u);
  ASSERT_EQ(agent.m_TVXHBA_ChassisContainsCard_map.size(), 2u);
  const auto* chassis = reinterpret_cast<const CIM_Chassis*>(
      agent.m_TVXHBA_ChassisContainsCard_map[0]->GroupComponent);
  EXPECT_EQ(text(chassis->Tag), "frame 7");
  EXPECT_TRUE(chassis->__name_space == "root/ibmse");
}

TEST_F(Platform, InstancesOfOtherClassesArePassedOver) {
  addChassis("frame 7");
  ProviderAgent& agent = buildHere();
  EXPECT_TRUE(agent.m_bOwnComputerSystem);
  EXPECT_EQ(text(agent.m_CIM_ComputerSystem_map[0]->CreationClassName), "CIM_ComputerSystem");
  EXPECT_EQ(log.count("up-call method failed"), 1u);
}

TEST_F(Platform, ServerWithoutSuchInstancesLeavesBothToTheProvider) {
  ProviderAgent& agent = buildHere();
  EXPECT_TRUE(agent.m_bOwnComputerSystem);
  EXPECT_EQ(agent.m_CIM_Chassis_map.size(), 1u);
  EXPECT_EQ(log.count("up-call method to get the chassis is failed"), 1u);
}

}  // namespace
}  // namespace cimrt::test
