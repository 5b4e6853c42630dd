// The five services, the access point and what they are tied to.
#include <dlfcn.h>
#include <sys/statvfs.h>

#include <cstdlib>

#include "Agent_Fixture.h"
#include "Instance_Checks.h"
#include "access/TVX_Runtime_Loader.h"
#include "agent/HostedServices.h"
#include "agent/Map_Insert.h"
#include "agent/RegisteredProfiles.h"

namespace {

bool rootIsReadOnly = false;

}  // namespace

// The program brings its own statvfs, so that the root can be read-only.
extern "C" int statvfs(const char* path, struct statvfs* info) noexcept {
  using Function = int (*)(const char*, struct statvfs*);
  static const auto real = reinterpret_cast<Function>(::dlsym(RTLD_NEXT, "statvfs"));
  if (!rootIsReadOnly) return real(path, info);
  *info = {};
  info->f_flag = ST_RDONLY;
  return 0;
}

namespace cimrt::test {
namespace {

class Hosted_Services : public Agent_Test {
 protected:
  ProviderAgent& build() {
    useScenario(
        R"({"cards": [{"model": "TVX1", "serial_number": "SN1", "ports": [
            {"wwpn": "10:00:00:00:00:00:00:01", "wwnn": "20:00:00:00:00:00:00:01"}]}]})");
    ProviderAgent& agent = startAgent();
    refresh(agent);
    return agent;
  }
};

struct Expected_Service {
  const char* className;
  const char* text;
  const char* name;
  const char* status;
  int requestedState;
};

template <class T>
void expectService(Instance_Map<T>& map, const CIM_ComputerSystem& system,
                   const Expected_Service& expected) {
  SCOPED_TRACE(expected.className);
  ASSERT_EQ(map.size(), 1u);
  const T& service = *map[0];
  EXPECT_EQ(textOf(service.SystemCreationClassName), textOf(system.CreationClassName));
  EXPECT_EQ(textOf(service.SystemName), textOf(system.Name));
  EXPECT_EQ(textOf(service.CreationClassName), expected.className);
  EXPECT_EQ(textOf(service.Name), expected.name);
  EXPECT_EQ(textOf(service.Description), expected.text);
  EXPECT_EQ(textOf(service.ElementName), expected.text);
  EXPECT_EQ(textOf(service.StartMode), "Automatic");
  EXPECT_EQ(numberOf(service.Started), 1);
  EXPECT_EQ(numberOf(service.EnabledState), 2);
  EXPECT_EQ(numberOf(service.EnabledDefault), 2);
  EXPECT_EQ(numberOf(service.HealthState), 5);
  EXPECT_EQ(numberOf(service.RequestedState), expected.requestedState);
  EXPECT_EQ(textOf(service.Status), expected.status);
  EXPECT_TRUE(service.__name_space == "root/torvex");
}

TEST_F(Hosted_Services, EveryServiceHasItsTexts) {
  ProviderAgent& agent = build();
  const CIM_ComputerSystem& system = *agent.m_CIM_ComputerSystem_map[0];
  expectService(
      agent.m_TVXHBA_SoftwareInstallationService_map, system,
      {"TVXHBA_SoftwareInstallationService", "Torvex FC HBA Software Installation Service",
       "TVXHBA_FCSoftwareInstallationService", "ok", 2});
  expectService(agent.m_TVXHBA_FCHBAWWNService_map, system,
                {"TVXHBA_FCHBAWWNService", "Torvex FC HBA WWN Management Service",
                 "TVXHBA_FCHBAWWNService", "Ok", 2});
  expectService(agent.m_TVXHBA_FCTagService_map, system,
                {"TVXHBA_FCTagService", "Torvex FC HBA Tagging Service", "TVXHBA_FCTagService",
                 "(null)", 12});
  expectService(agent.m_TVXHBA_BootBIOSService_map, system,
                {"TVXHBA_BootBIOSService", "Torvex FC HBA Boot BIOS Service",
                 "TVXHBA_BootBIOSService", "Ok", 12});
  expectService(agent.m_TVXHBA_FCHBADriverParamService_map, system,
                {"TVXHBA_FCHBADriverParamService", "Torvex FC HBA Set Driver Parameters Service",
                 "TVXHBA_FCHBADriverParamService", "OK", 12});
  EXPECT_EQ(textsOf(agent.m_TVXHBA_FCHBAWWNService_map[0]->StatusDescriptions),
            (std::vector<std::string>{"ok"}));
}

TEST_F(Hosted_Services, StartInOrder) {
  ProviderAgent& agent = build();
  const std::string host = textOf(agent.m_CIM_ComputerSystem_map[0]->Name);
  const std::vector<std::string> texts = {
      "Starting the SoftwareInstallationService",
      "Inside UpdateCURLCapabilities",
      "Hosted Service, Torvex Firmware Installation Service: " + host,
      "Install Service Affects System: " + host,
      "Computer System, Update Profile",
      "Element Capabilities, Torvex FC HBA Firmware Installation Service",
      "Starting the WWN Management Service",
      "FCHBA WWN Management Service Affects System: " + host,
      "Starting the FCTagService",
      "Starting the BootBIOSService",
      "Boot BIOS Service Affects System: " + host,
      "Starting the FCHBASetDriverParamService",
      "Ending the FCHBASetDriverSetParamService",
      "Install Service Affects FCPort: 2000000000000001",
      "Boot BIOS Service Affects FCPort: 2000000000000001",
      "FCHBA WWN Management Service Affects FCPort: 2000000000000001",
      "FCHBA Driver Param Service Affects FCPort: 2000000000000001",
      "TVXHBA FC Tag Service Affects FCPort: 2000000000000001",
      "Ending of Software Installation Service",
  };
  EXPECT_EQ(log.only(texts), texts);
}

TEST_F(Hosted_Services, SystemHostsEveryService) {
  ProviderAgent& agent = build();
  const Instance* system = agent.m_CIM_ComputerSystem_map[0];
  EXPECT_TRUE(tiesClones(agent.m_TVXHBA_HostedInstallationService_map[0], system,
                         agent.m_TVXHBA_SoftwareInstallationService_map[0]));
  EXPECT_TRUE(tiesClones(agent.m_TVXHBA_HostedFCHBAWWNService_map[0], system,
                         agent.m_TVXHBA_FCHBAWWNService_map[0]));
  EXPECT_TRUE(tiesClones(agent.m_TVXHBA_HostedFCTagService_map[0], system,
                         agent.m_TVXHBA_FCTagService_map[0]));
  EXPECT_TRUE(tiesClones(agent.m_TVXHBA_HostedBootBIOSService_map[0], system,
                         agent.m_TVXHBA_BootBIOSService_map[0]));
  EXPECT_TRUE(tiesClones(agent.m_TVXHBA_HostedFCHBADriverParamService_map[0], system,
                         agent.m_TVXHBA_FCHBADriverParamService_map[0]));
}

TEST_F(Hosted_Services, AffectedElementComesFirst) {
  ProviderAgent& agent = build();
  const Instance* system = agent.m_CIM_ComputerSystem_map[0];
  const Instance* port = agent.m_TVXHBA_FCPort_map[0];
  EXPECT_TRUE(tiesClones(agent.m_TVXHBA_InstallServiceAffectsSystem_map[0], system,
                         agent.m_TVXHBA_SoftwareInstallationService_map[0]));
  EXPECT_TRUE(tiesClones(agent.m_TVXHBA_FCHBAWWNServiceAffectsSystem_map[0], system,
                         agent.m_TVXHBA_FCHBAWWNService_map[0]));
  EXPECT_TRUE(tiesClones(agent.m_TVXHBA_BootBIOSServiceAffectsSystem_map[0], system,
                         agent.m_TVXHBA_BootBIOSService_map[0]));
  EXPECT_TRUE(tiesClones(agent.m_TVXHBA_BootBIOSServiceAffectsFCPort_map[0], port,
                         agent.m_TVXHBA_BootBIOSService_map[0]));
  EXPECT_TRUE(tiesClones(agent.m_TVXHBA_FCHBAWWNServiceAffectsFCPort_map[0], port,
                         agent.m_TVXHBA_FCHBAWWNService_map[0]));
  EXPECT_TRUE(tiesClones(agent.m_TVXHBA_FCHBADriverParamServiceAffectsFCPort_map[0], port,
                         agent.m_TVXHBA_FCHBADriverParamService_map[0]));
  EXPECT_TRUE(tiesClones(agent.m_TVXHBA_FCTagServiceAffectsPort_map[0], port,
                         agent.m_TVXHBA_FCTagService_map[0]));
  EXPECT_EQ(agent.m_TVXHBA_FCTagServiceAffectsPort_map.size(), 1u);
}

TEST_F(Hosted_Services, InstallationServiceHasCapabilitiesAndAProfile) {
  ProviderAgent& agent = build();
  const Instance* service = agent.m_TVXHBA_SoftwareInstallationService_map[0];
  ASSERT_EQ(agent.m_TVXHBA_SoftwareInstallationServiceCapabilities_map.size(), 1u);
  const auto& capabilities = *agent.m_TVXHBA_SoftwareInstallationServiceCapabilities_map[0];
  EXPECT_EQ(textOf(capabilities.InstanceID), "TVX:HBASoftwareInstallationServiceCapabilities");
  EXPECT_EQ(textOf(capabilities.Description), "Torvex Software Installation Service Capabilities");
  EXPECT_EQ(textOf(capabilities.ElementName), "Torvex Software Installation Service Capabilities");
  EXPECT_EQ(textsOf(capabilities.SupportedTargetTypes), (std::vector<std::string>{"FC HBA"}));
  EXPECT_EQ(numberOf(capabilities.CanAddToCollection), 0);
  EXPECT_EQ(textsOf(capabilities.OtherSupportedExtendedResourceTypeDescriptions),
            (std::vector<std::string>{"Torvex FC firmware files"}));
  ASSERT_GE(numbersOf(capabilities.SupportedURISchemes).size(), 1u);
  EXPECT_EQ(numbersOf(capabilities.SupportedURISchemes)[0], 3);
  EXPECT_TRUE(tiesClones(agent.m_TVXHBA_ElementCapabilities_map[0], service, &capabilities));
  EXPECT_TRUE(tiesClones(agent.m_TVXHBA_InstallServiceConformsToProfile_map[0],
                         findRegisteredProfile(agent, "Software Update"), service));
}

TEST_F(Hosted_Services, TaggingHasSoftwareOfItsOwn) {
  ProviderAgent& agent = build();
  const auto* identity = entryOf(agent.m_TVXHBA_SoftwareIdentity_map,
                                 &TVXHBA_SoftwareIdentity::InstanceID, "FC HBA TAG v1 0 0");
  ASSERT_NE(identity, nullptr);
  EXPECT_EQ(textOf(identity->ElementName), "FC HBA TAG v1 0 0");
  EXPECT_EQ(textOf(identity->Name), "FC HBA TAG v1 0 0");
  EXPECT_EQ(textOf(identity->Description), "Torvex FC TAG Software");
  EXPECT_EQ(textOf(identity->VersionString), "0");
  EXPECT_EQ(textOf(identity->Manufacturer), "Torvex Corporation");
  EXPECT_EQ(textsOf(identity->ClassificationDescriptions),
            (std::vector<std::string>{"FC Frames Tagging Software"}));
  EXPECT_EQ(numberOf(identity->IsEntity), 1);
  EXPECT_EQ(numberOf(identity->MajorVersion), 1);
  EXPECT_EQ(numberOf(identity->MinorVersion), 0);
  EXPECT_EQ(numberOf(identity->RevisionNumber), 0);
  EXPECT_EQ(numberOf(identity->BuildNumber), 0);
  ASSERT_EQ(agent.m_TVXHBA_FCTagElementSoftwareIdentity_map.size(), 1u);
  EXPECT_TRUE(tiesClones(agent.m_TVXHBA_FCTagElementSoftwareIdentity_map[0], identity,
                         agent.m_TVXHBA_FCTagService_map[0]));
}

TEST_F(Hosted_Services, FailedStartIsLoggedAndEndsTheBuild) {
  writeFile("etc/tvx_smis.conf", "https://manager\n");
  ProviderAgent& agent = build();
  struct Refusal {
    const char* failure;
    const char* insertFailure;
    Instance_Map_Base& map;
    Ref<Instance> kept;
  };
  const auto refusal = [](const char* failure, const char* insertFailure, Instance_Map_Base& map) {
    return Refusal{failure, insertFailure, map, Ref<Instance>(clone(map.at(0)))};
  };
  const Refusal refusals[] = {
      refusal("StartSoftwareInstallationService failed",
              "Insert Failed : m_TVXHBA_SoftwareInstallationService_map",
              agent.m_TVXHBA_SoftwareInstallationService_map),
      refusal("Failed to create WWN Services class", "Insert Failed : m_TVXHBA_FCHBAWWNService_map",
              agent.m_TVXHBA_FCHBAWWNService_map),
      refusal("StartFCTagService failed", "Insert Failed : m_TVXHBA_FCTagService_map",
              agent.m_TVXHBA_FCTagService_map),
      refusal("StartBootBIOSService failed", "Insert Failed : m_TVXHBA_BootBIOSService_map",
              agent.m_TVXHBA_BootBIOSService_map),
      refusal("StartFCHBADriverParamService failed",
              "Insert Failed : m_TVXHBA_FCHBADriverParamService_map",
              agent.m_TVXHBA_FCHBADriverParamService_map),
      refusal("CreateHBAAccessPointProfiles failed",
              "Insert Failed : m_TVXHBA_RemoteServiceAccessPoint_map",
              agent.m_TVXHBA_RemoteServiceAccessPoint_map),
  };
  for (const Refusal& expected : refusals) {
    SCOPED_TRACE(expected.failure);
    agent.clearAdapterMaps();
    auto system = makeInstance<CIM_ComputerSystem>();
    system->CreationClassName.set("CIM_ComputerSystem");
    system->Name.set(agent.m_HostName.c_str());
    Host_Build host{agent};
    host.system = insertInto(agent.m_CIM_ComputerSystem_map, std::move(system), "x");
    ASSERT_NE(expected.map.insert(clone(expected.kept.get())), Instance_Map_Base::npos);
    log.clear();
    EXPECT_EQ(startServices(host), MAP_BUILD_FAILED);
    EXPECT_EQ(log.level(expected.insertFailure), TVX_CRIT);
    EXPECT_EQ(log.level(expected.failure), TVX_CRIT);
    // Nothing after the failed step was started.
    EXPECT_EQ(host.driverIdentity, nullptr);
  }
}

TEST_F(Hosted_Services, AccessPointOfTheManagementPage) {
  writeFile("etc/tvx_smis.conf", "# page\n\n  https://manager:8443/launch\nhttp://second\n");
  ProviderAgent& agent = build();
  ASSERT_EQ(agent.m_TVXHBA_RemoteServiceAccessPoint_map.size(), 1u);
  const auto& point = *agent.m_TVXHBA_RemoteServiceAccessPoint_map[0];
  const CIM_ComputerSystem& system = *agent.m_CIM_ComputerSystem_map[0];
  EXPECT_EQ(textOf(point.Description), "FabriDesk WebLaunch URL");
  EXPECT_EQ(textOf(point.Name), "FabriDesk");
  EXPECT_EQ(textOf(point.ElementName), "TVX FC HBA:FabriDesk Management Interface");
  EXPECT_EQ(textOf(point.CreationClassName), "TVXHBA_RemoteServiceAccessPoint");
  EXPECT_EQ(textOf(point.SystemName), textOf(system.Name));
  EXPECT_EQ(textOf(point.SystemCreationClassName), "CIM_ComputerSystem");
  EXPECT_EQ(textOf(point.AccessInfo), "https://manager:8443/launch");
  EXPECT_EQ(numberOf(point.InfoFormat), 200);
  EXPECT_EQ(log.count("Remote Hosted Service Access Point"), 1u);
  EXPECT_TRUE(tiesClones(agent.m_TVXHBA_RemoteHostedAccessPoint_map[0], &system, &point));

  Host_Build host{agent};
  host.system = agent.m_CIM_ComputerSystem_map[0];
  EXPECT_EQ(CreateHBAAccessPointProfiles(host), MAP_BUILD_FAILED);
  EXPECT_EQ(log.level("Insert Failed : m_TVXHBA_RemoteServiceAccessPoint_map"), TVX_CRIT);
}

TEST_F(Hosted_Services, WithoutAnAddressThereIsNoAccessPointAndNoFailure) {
  writeFile("etc/tvx_smis.conf", "# only a comment\n");
  ProviderAgent& agent = build();
  EXPECT_EQ(agent.m_TVXHBA_RemoteServiceAccessPoint_map.size(), 0u);
  EXPECT_EQ(agent.m_TVXHBA_RemoteHostedAccessPoint_map.size(), 0u);
  EXPECT_EQ(agent.m_TVXHBA_FCPort_map.size(), 1u);
  EXPECT_EQ(log.count("Remote Hosted Service Access Point"), 0u);
}

// --- The transfer library --------------------------------------------------------------------

std::vector<std::string> opened;
std::string present;
int closeResult = 0;

const TVX_Dl_Operations LINKER = {
    [](const char* file, int) -> void* {
      opened.emplace_back(file);
      return present == file ? &present : nullptr;
    },
    [](void*, const char*) -> void* { return nullptr; },
    [](void*) { return closeResult; },
    []() -> const char* { return present.empty() ? "no such file" : nullptr; },
};

class Curl_Capabilities : public Agent_Test {
 protected:
  void SetUp() override {
    Agent_Test::SetUp();
    opened.clear();
    present.clear();
    closeResult = 0;
    capabilities = makeInstance<TVXHBA_SoftwareInstallationServiceCapabilities>();
    capabilities->SupportedURISchemes.set({3});
    setDlOperations(&LINKER);
  }
  void TearDown() override {
    setDlOperations(nullptr);
    Agent_Test::TearDown();
  }

  Ref<TVXHBA_SoftwareInstallationServiceCapabilities> capabilities;
};

TEST_F(Curl_Capabilities, WithoutTheLibraryOnlyFilesAreOffered) {
  UpdateCURLCapabilities(*capabilities);
  EXPECT_EQ(opened, (std::vector<std::string>{"/lib/libcurl.so.4", "/usr/lib/libcurl.so.4",
                                              "libcurl.so", "curl.dll"}));
  const std::vector<std::string> texts = {
      "Inside UpdateCURLCapabilities",
      "Searching for /lib Curl on the machine",
      "dlopen returned for /lib/libcurl.so.4 = no such file\n",
      "Searching for /usr/lib/ Curl on the machine",
      "dlopen returned for /usr/lib/libcurl.so.4 = no such file\n",
      "Checking with libcurl.so system location for libcurl",
      "dlopen returned for libcurl.so = no such file\n",
      "Checking with curl.dll windows system location for libcurl",
      "libcurl is not present. only file type URIScheme will be supported"};
  EXPECT_EQ(log.only(texts), texts);
  EXPECT_EQ(log.level(texts.back()), TVX_INFO);
  EXPECT_EQ(numbersOf(capabilities->SupportedURISchemes), (std::vector<std::uint16_t>{3}));
}

TEST_F(Curl_Capabilities, WithItTheNetworkSchemesAreOffered) {
  present = "libcurl.so";
  UpdateCURLCapabilities(*capabilities);
  EXPECT_EQ(opened.size(), 3u);
  EXPECT_EQ(numbersOf(capabilities->SupportedURISchemes),
            (std::vector<std::uint16_t>{3, 4, 5, 6, 8}));
  EXPECT_EQ(log.count("ERROR: UNABLE TO CLOSE DYNAMIC LIB"), 0u);
}

/// Asks with a read-only root. 0 if files alone are offered and no library was looked for.
int askOnReadOnlyRoot() {
  rootIsReadOnly = true;
  present = "libcurl.so";
  setDlOperations(&LINKER);
  const auto capabilities = makeInstance<TVXHBA_SoftwareInstallationServiceCapabilities>();
  capabilities->SupportedURISchemes.set({3});
  UpdateCURLCapabilities(*capabilities);
  return opened.empty() && numbersOf(capabilities->SupportedURISchemes).size() == 1 ? 0 : 1;
}

// A process keeps what it once saw of the root: this one has to be new.
TEST(Curl_Capabilities_Read_Only, AFetchedFileHasNowhereToGo) {
  GTEST_FLAG_SET(death_test_style, "threadsafe");
  EXPECT_EXIT(std::_Exit(askOnReadOnlyRoot()), testing::ExitedWithCode(0), "");
}

TEST_F(Curl_Capabilities, FailedCloseIsLogged) {
  present = "/lib/libcurl.so.4";
  closeResult = -1;
  UpdateCURLCapabilities(*capabilities);
  EXPECT_EQ(opened.size(), 1u);
  EXPECT_EQ(log.level("ERROR: UNABLE TO CLOSE DYNAMIC LIB"), TVX_ERR);
  EXPECT_EQ(numbersOf(capabilities->SupportedURISchemes).size(), 5u);
}

}  // namespace
}  // namespace cimrt::test
