// The profile classes that are built on the spot, and the up-call for the Base Server profile.
#include "logs/Profile_Providers.h"

#include "../agent/Agent_Fixture.h"
#include "../agent/Instance_Checks.h"
#include "agent/Map_Insert.h"
#include "agent/RegisteredProfiles.h"
#include "runtime/Thread_Context.h"

namespace cimrt::test {
namespace {

const std::vector<std::string> REFERENCED = {"Software Inventory",
                                             "Physical Package",
                                             "Host Discovered Resources",
                                             "FC HBA",
                                             "Storage HBA",
                                             "FC Initiator Ports",
                                             "Software Update",
                                             "Record Log",
                                             "Software",
                                             "Access Points",
                                             "PCI Device",
                                             "FCHBA Diagnostics"};

/// A CIM server that answers one enumeration with prepared instances.
class Server : public Thread_Context {
 public:
  Server() { push(this); }
  ~Server() override { pop(); }

  void add(Ref<Instance> instance) { m_Answers.push_back(std::move(instance)); }
  std::string nameSpace;      ///< of the last enumeration
  std::string className;      ///< of its model
  std::size_t destroyed = 0;  ///< enumerators

  void* instance_enumerator_create(const char* name_space, const Instance* model) override {
    nameSpace = name_space;
    className = model->meta_class->name;
    m_Next = 0;
    return this;
  }
  void instance_enumerator_destroy(void*) override { destroyed++; }
  bool instance_enumerator_more(void*) override { return m_Next < m_Answers.size(); }
  void instance_enumerator_next(void*) override { m_Next++; }
  Ref<Instance> instance_enumerator_get(void*) override {
    return m_Next < m_Answers.size() ? m_Answers[m_Next] : Ref<Instance>();
  }
  std::uint32_t references(std::size_t i) const { return m_Answers[i]->refs; }

  Thread_Context* thread_create_hook(void*) override { return nullptr; }
  void thread_start_hook() override {}
  void thread_exit_hook() override {}
  Ref<Instance> get_instance(const char*, const Instance*) override { return Ref<Instance>(); }
  int create_instance(const char*, const Instance*) override { return -1; }
  int delete_instance(const char*, const Instance*) override { return -1; }
  int modify_instance(const char*, const Instance*) override { return -1; }
  int invoke_method(const char*, const Instance*, Instance*) override { return -1; }
  void allow_unload(bool) override {}
  bool get_username(String&) override { return false; }

 private:
  std::vector<Ref<Instance>> m_Answers;
  std::size_t m_Next = 0;
};

Ref<Instance> serverProfile(const char* id, const char* name) {
  auto profile = makeInstance<PG_RegisteredProfile>("root/interop");
  profile->InstanceID.set(id);
  if (name) profile->RegisteredName.set(name);
  return Ref<Instance>(profile.release());
}

class Profile_Providers : public Agent_Test {};

TEST_F(Profile_Providers, AllFourteenProfilesAreDeliveredApartFromTheMap) {
  ProviderAgent& agent = startAgent();
  Delivered delivered;
  EXPECT_EQ(TVXHBA_RegisteredProfile_Provider().enum_instances(nullptr, delivered.handler()), 0);
  ASSERT_EQ(delivered.size(), 14u);
  for (std::size_t i = 0; i < 14; i++) {
    const auto* profile = delivered.at<TVXHBA_RegisteredProfile>(i);
    EXPECT_EQ(textOf(profile->RegisteredName), enumeratedProfiles()[i].name);
    EXPECT_TRUE(profile->__name_space == "root/pg_interop");
  }
  EXPECT_EQ(agent.m_TVXHBA_RegisteredProfile_map.size(), 0u);
  EXPECT_EQ(log.level("TVXHBA_RegisteredProfile_Provider::enum_instances()"), TVX_DBG);
}

TEST_F(Profile_Providers, HandlerEndsTheDelivery) {
  startAgent();
  Delivered profiles;
  profiles.limit = 3;
  EXPECT_EQ(TVXHBA_RegisteredProfile_Provider().enum_instances(nullptr, profiles.handler()), 0);
  EXPECT_EQ(profiles.size(), 3u);
  Delivered references;
  references.limit = 1;
  EXPECT_EQ(TVXHBA_ReferencedProfile_Provider().enum_instances(nullptr, references.handler()), 0);
  EXPECT_EQ(references.size(), 1u);
}

TEST_F(Profile_Providers, ProfileRegistrationRefersToTwelve) {
  startAgent();
  Delivered delivered;
  EXPECT_EQ(TVXHBA_ReferencedProfile_Provider().enum_instances(nullptr, delivered.handler()), 0);
  EXPECT_EQ(log.level("TVXHBA_ReferencedProfile_Provider::enum_instances()"), TVX_DBG);
  ASSERT_EQ(delivered.size(), REFERENCED.size());
  for (std::size_t i = 0; i < REFERENCED.size(); i++) {
    const auto* association = delivered.at<TVXHBA_ReferencedProfile>(i);
    EXPECT_TRUE(association->__name_space == "root/torvex");
    EXPECT_EQ(textOf(association->Antecedent->InstanceID), "TVX:Profile Registration");
    EXPECT_EQ(textOf(association->Dependent->RegisteredName), REFERENCED[i]);
    EXPECT_TRUE(association->Dependent->__name_space == "root/pg_interop");
  }
}

TEST_F(Profile_Providers, WithoutLibrariesEveryClassIsEmpty) {
  addFault(R"({"call": "LRM_InitLib", "status": 1})");
  ASSERT_FALSE(startAgent().isLoaded());
  Delivered delivered;
  EXPECT_EQ(TVXHBA_RegisteredProfile_Provider().enum_instances(nullptr, delivered.handler()), 0);
  EXPECT_EQ(TVXHBA_ReferencedProfile_Provider().enum_instances(nullptr, delivered.handler()), 0);
  EXPECT_EQ(
      TVXHBA_BaseServerReferencedProfile_Provider().enum_instances(nullptr, delivered.handler()),
      0);
  EXPECT_EQ(delivered.size(), 0u);
}

TEST_F(Profile_Providers, WithoutABaseServerProfileItsClassIsEmpty) {
  startAgent();
  Delivered delivered;
  log.clear();
  EXPECT_EQ(
      TVXHBA_BaseServerReferencedProfile_Provider().enum_instances(nullptr, delivered.handler()),
      0);
  EXPECT_EQ(delivered.size(), 0u);
  const std::vector<std::string> texts = {
      "up-call to enumerate OMC_RegisteredBaseServerProfile/PG_RegisteredProfile started",
      "up-call to enumerate OMC_RegisteredBaseServerProfile/OMC_RegisteredBaseServerProfile/"
      "PG_RegisteredProfile created--calling now",
      "up-call to enumerate OMC_RegisteredBaseServerProfile/PG_RegisteredProfile failed"};
  EXPECT_EQ(log.only(texts), texts);
  for (const Logged& message : log.all()) EXPECT_EQ(message.level, TVX_DBG) << message.text;
}

TEST_F(Profile_Providers, SecondResultIsTheBaseServerProfile) {
  startAgent();
  Server server;
  server.add(serverProfile("one", "Some Other"));
  server.add(serverProfile("two", "Base Server"));
  server.add(serverProfile("three", "Base Server"));
  Delivered delivered;
  EXPECT_EQ(
      TVXHBA_BaseServerReferencedProfile_Provider().enum_instances(nullptr, delivered.handler()),
      0);
  EXPECT_EQ(log.level("TVXHBA_BaseServerReferencedProfile_Provider::enum_instances()"), TVX_DBG);
  EXPECT_EQ(server.nameSpace, "root/pg_interop");
  EXPECT_EQ(server.className, "PG_RegisteredProfile");
  EXPECT_EQ(server.destroyed, 1u);
  ASSERT_EQ(delivered.size(), REFERENCED.size());
  for (std::size_t i = 0; i < REFERENCED.size(); i++) {
    const auto* association = delivered.at<TVXHBA_BaseServerReferencedProfile>(i);
    EXPECT_EQ(textOf(association->Antecedent->InstanceID), "two");
    EXPECT_TRUE(association->Antecedent->__name_space == "root/interop");
    EXPECT_EQ(textOf(association->Dependent->RegisteredName), REFERENCED[i]);
  }
  for (std::size_t i = 0; i < 3; i++) EXPECT_EQ(server.references(i), 1u) << i;
  EXPECT_EQ(log.count("up-call to enumerate OMC_RegisteredBaseServerProfile/PG_RegisteredProfile "
                      "Passed"),
            1u);
  EXPECT_EQ(log.count("up-call - found the correct OMC_RegisteredBaseServerProfile/"
                      "PG_RegisteredProfile to link"),
            1u);
}

TEST_F(Profile_Providers, ServerWithoutABaseServerProfileGivesNothing) {
  startAgent();
  Server server;
  server.add(serverProfile("one", nullptr));
  auto other = makeInstance<TVXHBA_SoftwareIdentity>();
  other->Name.set("Base Server");
  server.add(Ref<Instance>(other.release()));
  Delivered delivered;
  EXPECT_EQ(
      TVXHBA_BaseServerReferencedProfile_Provider().enum_instances(nullptr, delivered.handler()),
      0);
  EXPECT_EQ(delivered.size(), 0u);
  EXPECT_EQ(log.count("up-call to enumerate OMC_RegisteredBaseServerProfile/PG_RegisteredProfile "
                      "Passed"),
            1u);
}

}  // namespace
}  // namespace cimrt::test
