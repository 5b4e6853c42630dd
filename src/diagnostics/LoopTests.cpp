// The tests that send a pattern: loopbacks, echo and ping.
#include "diagnostics/TestSteps.h"

namespace cimrt {

namespace {

/// Room that the library is told for the attributes of a port, in bytes.
constexpr std::uint32_t PORT_ATTRIBUTES_ROOM = 4096;
constexpr std::uint32_t PORT_DISABLED = 22;
constexpr std::uint32_t NAME_BYTES = 8;

/// Kinds of loopback, as the library takes them.
constexpr std::uint32_t OVER_THE_PLUG = 0;
constexpr std::uint32_t INSIDE = 1;

constexpr std::uint64_t PLUG_PAUSE = 1'000'000;

/// What is sent how often, from the settings of a test.
struct Pattern {
  explicit Pattern(const TVXHBA_FCHBADiagnosticSettingData& settings)
      : haltOnError(!settings.HaltOnError.is_null() && settings.HaltOnError.value) {
    if (settings.LoopControlParameter.value.size() != 0)
      cycles = static_cast<std::uint32_t>(
          std::strtoul(settings.LoopControlParameter.value[0].c_str(), nullptr, 10));
    for (const std::uint8_t byte : settings.BufferPattern.value) bytes += static_cast<char>(byte);
  }
  void logCycles() const {
    TVX_LOG(TVX_DBG, "Number of test cycles set to run : %d ", static_cast<int>(cycles));
    TVX_LOG(TVX_DBG, "HaltOnError value : %d ", static_cast<int>(haltOnError));
  }

  std::uint32_t cycles = 0;
  std::uint32_t haltOnError;
  std::string bytes;  ///< hexadecimal digits
};

bool seesTargets(const HBA_WWN& wwpn) {
  HBA_FCPTARGETMAPPING mapping{};
  mapping.NumberOfEntries = 1;
  LRM_GetFcpTargetMapping(wwpn, &mapping);
  return mapping.NumberOfEntries != 0;
}

/// False if the port can be read and shows that there is no plug.
bool mayHavePlug(const HBA_WWN& wwpn) {
  tvxSleep(PLUG_PAUSE);
  Port_View port;
  if (port.read(wwpn) != RM_OK) return true;
  if (port.hasNoFabric() && !seesTargets(wwpn)) return true;
  TVX_LOG(TVX_DBG,
          "Loopback plug is not detected. Unabled to run test. Install loopback plug and make sure "
          "HBA Port is Up/Ready.. ");
  return false;
}

RM_STATUS startLoopback(int type, const HBA_WWN& wwpn, const Pattern& pattern, std::uint32_t& id) {
  if (type == LOOPBACK_HOST)
    return LRM_DiagPciLoopBackTestV2(wwpn, pattern.cycles, pattern.haltOnError, &id, 0,
                                     pattern.bytes.c_str());
  return LRM_DiagLoopBackTestV3(wwpn, type == LOOPBACK_INTERNAL ? INSIDE : OVER_THE_PLUG,
                                pattern.cycles, pattern.haltOnError, &id, 0, pattern.bytes.c_str());
}

/// The target of a test. 0, or 1 with the failure logged.
RM_STATUS readTarget(const String& targetDevice, HBA_WWN& target) {
  char hbaName[TVX_HBA_NAME_LENGTH + 1] = {};
  if (TVX_MethodWrapper::Id2HBAName(hbaName, targetDevice.c_str()) != RM_OK) {
    TVX_LOG(TVX_DBG, "TVX_Diagnostics::EchoTest::Id2HBAName failed");
    return RM_ERROR;
  }
  if (TVX_MethodWrapper::str2HBAName(&target, hbaName) != RM_OK) {
    TVX_LOG(TVX_DBG, "TVX_Diagnostics::EchoTest::str2HBAName failed");
    return RM_ERROR;
  }
  return RM_OK;
}

/// A port that takes no part in anything isn't tested: that is told, and no failure.
bool isStopped(const Port_View& port, const Test_Call& call) {
  if (!port.isDisabled()) return false;
  TVX_LOG(TVX_DBG, "Source HBA port is disabled. Unable to start %s ", call.testName());
  return true;
}

}  // namespace

// --- The port

RM_STATUS Port_View::read(const HBA_WWN& wwpn) {
  m_Block = allocateAttributeBlock(PORT_ATTRIBUTES_ROOM);
  std::uint32_t size = PORT_ATTRIBUTES_ROOM;
  const RM_STATUS status =
      m_Block ? LRM_GetPortAttributes(wwpn, m_Block.get(), &size) : RM_ERROR_NO_MEMORY;
  if (status != RM_OK)
    TVX_LOG(TVX_DBG, "RM_GetPortAttributes command failed. Exited with error code : %d", status);
  return status;
}

std::uint32_t Port_View::number(std::uint32_t key) const {
  std::uint32_t value = 0;
  attributeNumber(findAttribute(m_Block.get(), key), value);
  return value;
}

bool Port_View::isDisabled() const {
  return number(RM_PA_PORT_STATE) == PORT_DISABLED;
}

bool Port_View::hasNoFabric() const {
  const std::uint32_t type = number(RM_PA_PORT_TYPE);
  if (type != HBA_PORTTYPE_LPORT && type != HBA_PORTTYPE_PTP) return false;
  const TVX_Attribute fabric = findAttribute(m_Block.get(), RM_PA_FABRIC_NAME);
  for (std::uint32_t i = 0; i < NAME_BYTES && i < fabric.length; i++)
    if (fabric.value[i] != 0) return false;
  return true;
}

// --- The tests

const TVX_DiagTestFunc::Poll_Texts TVX_DiagTestFunc::LOOPBACK_TEXTS = {
    "Polling for the results.. : %d", "%s Resulted with Failure, Result - %s",
    "%s Unknown Error, Exited with error code: %d"};

const TVX_DiagTestFunc::Poll_Texts TVX_DiagTestFunc::ECHO_TEXTS = {
    "Polling for the results.. : %d", "%s Resulted with Failure, Result - %s ",
    "%s Unknown error, Exited with error code : %d"};

RM_STATUS TVX_DiagTestFunc::LoopBackTest(Test_Call& call, int type) {
  Port_View port;
  if (const RM_STATUS status = port.read(call.wwpn); status != RM_OK) return status;
  if (isStopped(port, call)) return RM_OK;
  if (type != LOOPBACK_INTERNAL && type != LOOPBACK_HOST && type != LOOPBACK_EXTERNAL) {
    TVX_LOG(TVX_DBG, "Error: Wrong Test type passed: %d", type);
    return RM_ERROR_INVALID_POINTER;
  }
  const Pattern pattern(call.settings);
  TVX_LOG(TVX_DBG, "%s", call.testName());
  pattern.logCycles();
  TVX_LOG(TVX_DBG, "The Input pattern used for testing %s", pattern.bytes.c_str());
  if (type == LOOPBACK_EXTERNAL && !mayHavePlug(call.wwpn)) return RM_ERROR;
  std::uint32_t id = 0;
  const RM_STATUS status = startLoopback(type, call.wwpn, pattern, id);
  return finish(call, status, id, LOOPBACK_TEXTS);
}

RM_STATUS TVX_DiagTestFunc::EchoTest(Test_Call& call) {
  TVX_LOG(TVX_DBG, "TVX_Diagnostics::EchoTest/Ping");
  Port_View port;
  if (const RM_STATUS status = port.read(call.wwpn); status != RM_OK) return status;
  if (isStopped(port, call)) return RM_OK;
  const String& targetDevice = call.settings.TargetDevice.value;
  HBA_WWN target{};
  if (const RM_STATUS status = readTarget(targetDevice, target); status != RM_OK) return status;
  const Pattern pattern(call.settings);
  TVX_LOG(TVX_DBG, "Diagnostics Name : %s", call.testName());
  pattern.logCycles();
  TVX_LOG(TVX_DBG, "Pattern used for testing %s", pattern.bytes.c_str());
  TVX_LOG(TVX_DBG, "TargetDevice WWPN to check : %s", targetDevice.c_str());
  std::uint32_t id = 0;
  const RM_STATUS status = LRM_DiagEchoTestV2(call.wwpn, target, pattern.cycles,
                                              pattern.haltOnError, &id, 0, pattern.bytes.c_str());
  return finish(call, status, id, ECHO_TEXTS);
}

}  // namespace cimrt
