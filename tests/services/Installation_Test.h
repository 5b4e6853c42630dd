// The installation service over the simulated libraries, with a port that takes firmware at its
// reset and one that takes it at the next reboot.
#pragma once

#include <dlfcn.h>

#include <string>
#include <vector>

#include "../agent/Agent_Fixture.h"
#include "../agent/Instance_Checks.h"
#include "access/TVX_MethodWrapper.h"
#include "agent/Map_Insert.h"
#include "common/TVX_Memory.h"
#include "services/TVXHBA_SoftwareInstallationService_Provider.h"
#include "services/TVX_SoftwareInstallation.h"
#include "support/Firmware_File.h"
#include "support/Working_Folder.h"
#include "tvxsim/tvxsim.h"

namespace cimrt::test {

/// The file that a linker in the middle takes for libcurl; empty: there is none.
inline std::string& libcurl() {
  static std::string file;
  return file;
}

inline constexpr TVX_Dl_Operations LINKER = {
    [](const char* file, int mode) -> void* {
      const std::string name = file;
      if (name.find("curl") == std::string::npos) return ::dlopen(file, mode);
      return name == "libcurl.so" && !libcurl().empty() ? ::dlopen(libcurl().c_str(), mode)
                                                        : nullptr;
    },
    [](void* handle, const char* name) { return ::dlsym(handle, name); },
    [](void* handle) { return ::dlclose(handle); },
    []() -> const char* { return ::dlerror(); },
};

class Installation : public Agent_Test {
 protected:
  using Options = std::vector<std::uint16_t>;
  using Texts = std::vector<std::string>;

  static constexpr const char* FIRST = "10000000000000A1";
  static constexpr const char* REBOOTING = "10000000000000B1";
  static constexpr const char* CONVERGED = "TVXUCNA_SoftwareInstallationService";
  /// A port that takes firmware at its reset, and one that takes it at the next reboot.
  static constexpr const char* TWO_PORTS = R"({"cards": [
  {"serial_number": "A", "model": "TVX16002", "firmware_version": "2.01a4",
   "ports": [{"wwpn": "10000000000000A1", "features": {"201": 1, "511": 7}}]},
  {"serial_number": "B", "model": "TVX8102", "firmware_version": "1.12a7",
   "ports": [{"wwpn": "10000000000000B1", "firmware": {"activation": "reboot"}}]}]})";

  static void* noMemory(std::size_t) { return nullptr; }

  void SetUp() override {
    Agent_Test::SetUp();
    libcurl().clear();
    setDlOperations(&LINKER);
    useScenario(TWO_PORTS);
    agent = &startAgent();
    refresh(*agent);
    service.reset(clone(agent->m_TVXHBA_SoftwareInstallationService_map[0]));
    target.reset(clone(port(FIRST)));
    folder.write("image.fw", tvx::test::firmwareImage("2.02a1", "TVX16"));
    folder.write("small.fw", tvx::test::firmwareImage("1.13a1", "TVX8"));
    tvxsim_forget_calls();
    log.clear();
  }
  void TearDown() override {
    awaitIdle(*agent);
    Agent_Test::TearDown();
    setDlOperations(nullptr);
    unref(job);
  }

  TVXHBA_FCPort* port(const char* deviceID) const {
    return findByText(agent->m_TVXHBA_FCPort_map, &TVXHBA_FCPort::DeviceID, deviceID);
  }
  std::string onFlash(const char* deviceID) const {
    const TVXHBA_SoftwareIdentity* identity = findByText(
        agent->m_TVXHBA_SoftwareIdentity_map, &TVXHBA_SoftwareIdentity::PortWWN, deviceID);
    return identity ? textOf(identity->FirmwareOnFlash) : "(no identity)";
  }
  void aim(const char* deviceID) { target.reset(clone(port(deviceID))); }
  /// Makes the agent forget its services: then it takes any.
  void forgetServices() {
    Ranked_Lock lock(agent->m_DataMutex);
    agent->m_TVXHBA_SoftwareInstallationService_map.clear();
  }
  std::uint32_t takeResult() {
    EXPECT_FALSE(result.is_null());
    EXPECT_TRUE(isFree(agent->m_DataMutex));
    return result.value;
  }

  static Property<Array<std::uint16_t>> listOf(const Options& options) {
    return {Array<std::uint16_t>(options.data(), options.size()), 0};
  }
  static Property<Array<String>> listOf(const Texts& texts) {
    Property<Array<String>> list{{}, 0};
    for (const std::string& text : texts) list.append(String(text.c_str()));
    return list;
  }

  const CIM_ManagedElement* element() const {
    return static_cast<const CIM_ManagedElement*>(target.get());
  }
  std::uint32_t fromURI(const std::string& uri, const Options& options = {}) {
    result = {0, 1};
    EXPECT_EQ(provider.InstallFromURI(service.get(), job, {String(uri.c_str()), 0}, element(),
                                      listOf(options), listOf(Texts{}), result),
              INVOKE_METHOD_OK);
    return takeResult();
  }
  std::uint32_t fromBytes(const std::string& bytes, const Options& options, const Texts& values) {
    const auto* data = reinterpret_cast<const std::uint8_t*>(bytes.data());
    result = {0, 1};
    EXPECT_EQ(provider.InstallFromByteStream(service.get(), job,
                                             {Array<std::uint8_t>(data, bytes.size()), 0},
                                             element(), listOf(options), listOf(values), result),
              INVOKE_METHOD_OK);
    return takeResult();
  }
  const TVXHBA_FCPort* targetPort() const {
    return static_cast<const TVXHBA_FCPort*>(target.get());
  }
  std::uint32_t reset() {
    result = {0, 1};
    EXPECT_EQ(provider.ResetHBA(service.get(), targetPort(), result), INVOKE_METHOD_OK);
    return takeResult();
  }
  std::uint32_t setFEC(const Property<bool>& flag) {
    result = {0, 1};
    EXPECT_EQ(provider.SetFECState(service.get(), targetPort(), flag, result), INVOKE_METHOD_OK);
    return takeResult();
  }
  std::uint32_t setEnabled(const Property<bool>& flag) {
    result = {0, 1};
    EXPECT_EQ(provider.SetPortEnabled(service.get(), targetPort(), flag, config, result),
              INVOKE_METHOD_OK);
    return takeResult();
  }
  std::uint32_t getFeatures() {
    result = {0, 1};
    EXPECT_EQ(provider.GetHBAFeatures(service.get(), targetPort(), features, result),
              INVOKE_METHOD_OK);
    return takeResult();
  }

  tvx::test::Working_Folder folder;
  ProviderAgent* agent = nullptr;
  TVXHBA_SoftwareInstallationService_Provider provider;
  Ref<TVXHBA_SoftwareInstallationService> service;
  Ref<Instance> target;
  CIM_ConcreteJob* job = nullptr;
  Property<std::uint32_t> result{0, 1};
  Property<std::uint8_t> config{0, 1};
  Property<Array<std::uint8_t>> features{{}, 1};
};

}  // namespace cimrt::test
