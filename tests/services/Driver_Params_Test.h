// The agent over two ports with parameters of the driver, each a card of its own.
#pragma once

#include <cstdlib>
#include <string>
#include <vector>

#include "../agent/Agent_Fixture.h"
#include "../agent/Instance_Checks.h"
#include "access/TVX_MethodWrapper.h"
#include "common/TVX_Memory.h"
#include "model/TVX_Data.h"
#include "services/TVX_DriverParams.h"
#include "tvxsim/tvxsim.h"

namespace cimrt::test {

class Driver_Params : public Agent_Test {
 protected:
  static constexpr std::uint64_t SECOND = 1'000'000;
  static constexpr const char* FIRST = "10000000000000A1";
  static constexpr const char* SECOND_PORT = "10000000000000A2";
  static constexpr const char* ALLOCATION =
      "ERROR: tvxcimGetDriverParamsGlobal: Unable to allocate buffer";
  static constexpr const char* TWO_PORTS = R"({
  "global_driver_params": [
    {"name": "log_level", "low": 0, "high": 9, "default": 2, "current": 3, "export": 1,
     "dynamic": 1, "help": "How much is logged"}],
  "cards": [
    {"serial_number": "A", "ports": [{"wwpn": "10000000000000A1", "driver_params": [
      {"name": "depth", "low": 1, "high": 512, "default": 30, "current": 31, "export": 2,
       "dynamic": 3, "help": "Commands for each unit"},
      {"name": "speed", "low": 0, "high": 32, "default": 0, "current": 16}]}]},
    {"serial_number": "B", "ports": [{"wwpn": "10000000000000A2", "driver_params": [
      {"name": "depth", "low": 1, "high": 512, "default": 30, "current": 40}]}]}]})";

  static void* noMemory(std::size_t) { return nullptr; }
  /// Gives as many blocks as `allocationsLeft` tells.
  static void* someMemory(std::size_t size) {
    return allocationsLeft-- > 0 ? std::calloc(1, size != 0 ? size : 1) : nullptr;
  }
  static inline std::size_t allocationsLeft = 0;
  /// Gives every block, and keeps their sizes in `sizes`.
  static void* notedMemory(std::size_t size) {
    sizes.push_back(size);
    return std::calloc(1, size);
  }
  static inline std::vector<std::size_t> sizes;

  ProviderAgent& build(const std::string& scenario = TWO_PORTS) { return builtAgent(scenario); }
  static void readLocal(ProviderAgent& agent, Delivered& to) {
    agent.enumActiveInstances(agent.m_TVXHBA_DriverParams_map, to.handler(),
                              updateLocalDriverParams);
  }
  static void readGlobal(ProviderAgent& agent, Delivered& to) {
    agent.enumActiveInstances(agent.m_TVXHBA_DriverParamGlobal_map, to.handler(),
                              updateGlobalDriverParams);
  }
  /// Sets a parameter of a port as its owner would, apart from the provider.
  void set(const char* port, const char* text, std::uint32_t controlWord = 0) {
    HBA_WWN wwpn{};
    ASSERT_EQ(TVX_MethodWrapper::string2HBAName(&wwpn, port), 1);
    ASSERT_EQ(LRM_SetDriverParam(wwpn, text, controlWord), RM_OK);
  }
  /// Runs an update as the active form does: the texts that it logged, all at `TVX_DBG`.
  std::vector<std::string> stepsOf(ProviderAgent& agent, Live_Update update) {
    log.clear();
    {
      Ranked_Lock data(agent.m_DataMutex);
      update(agent);
    }
    std::vector<std::string> texts;
    for (const Logged& line : log.all()) {
      EXPECT_EQ(line.level, TVX_DBG) << line.text;
      texts.push_back(line.text);
    }
    return texts;
  }
  static std::int64_t current(const Delivered& from, std::size_t i) {
    return numberOf(from.at<TVXHBA_DriverParams>(i)->current);
  }
  /// A list of so many parameters, "p0" and on, in JSON.
  static std::string manyParams(int count) {
    std::string json;
    for (int i = 0; i < count; i++)
      json += std::string(i == 0 ? "" : ",") + R"({"name": "p)" + std::to_string(i) +
              R"(", "high": 1000, "current": )" + std::to_string(i) + "}";
    return json;
  }
};

}  // namespace cimrt::test
