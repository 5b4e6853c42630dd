// Setting a parameter of the driver through its service.
#include <vector>

#include "../agent/Lock_Witness.h"
#include "Driver_Params_Test.h"
#include "services/Service_Checks.h"
#include "services/TVXHBA_FCHBADriverParamService_Provider.h"

namespace cimrt::test {
namespace {

/// One call of `SetDriverParameter`.
class Set_Driver_Parameter : public Driver_Params {
 protected:
  void SetUp() override {
    Driver_Params::SetUp();
    agent = &build();
    service = agent->m_TVXHBA_FCHBADriverParamService_map[0];
    target = agent->m_TVXHBA_FCPort_map[0];
    log.clear();
  }
  std::uint32_t call(const char* parameter, const char* value, bool permanent = false,
                     bool global = false) {
    Property<bool> bPermanent{permanent, 0};
    Property<bool> bGlobal{global, 0};
    Property<String> strParam{String(), 1};
    Property<String> strValue{String(), 1};
    if (parameter) strParam.set(parameter);
    if (value) strValue.set(value);
    Property<std::uint32_t> result{0, 1};
    EXPECT_EQ(TVXHBA_FCHBADriverParamService_Provider().SetDriverParameter(
                  service, target, bPermanent, bGlobal, strParam, strValue, result),
              0);
    EXPECT_FALSE(result.is_null());
    return result.value;
  }
  ProviderAgent* agent = nullptr;
  const TVXHBA_FCHBADriverParamService* service = nullptr;
  const TVXHBA_FCPort* target = nullptr;
};

TEST_F(Set_Driver_Parameter, SetsTheParameterOfThePortAndLeavesTheInstance) {
  EXPECT_EQ(call("depth", "64"), 0u);
  EXPECT_EQ(numberOf(agent->m_TVXHBA_DriverParams_map[0]->current), 31);
  turnClock(5 * SECOND);
  refresh(*agent);
  EXPECT_EQ(numberOf(agent->m_TVXHBA_DriverParams_map[0]->current), 64);
  const std::vector<std::string> steps = {
      "TVXHBA_FCHBADriverParamService_Provider::SetDriverParameter()",
      "Checking the FCPort",
      "Valid FCPort WWPN Passed",
      "Entering TVXHBA_FCHBADriverParamService_Provider::SetDriverParam(): tvxcimSetDriverParam",
      "tvxcimSetDriverParam Parameters ::",
      "CW1=0 CW2=0 pDriverParam=depth pVal=64, deviceID=10000000000000A1",
      "pParamStr:[depth=64], Ccw:[0]",
      "Calling RM_SetDriverParam",
      "TVXHBA_FCHBADriverParamService_Provider::tvxcimSetDriverParam Succeeded"};
  EXPECT_EQ(log.only(steps), steps);
  EXPECT_EQ(log.all().at(0).text, " Entering BuildCimrtInfo()");
  EXPECT_EQ(log.level(steps.back()), TVX_INFO);
  for (std::size_t i = 0; i + 1 < steps.size(); i++) EXPECT_EQ(log.level(steps[i]), TVX_DBG);
}

TEST_F(Set_Driver_Parameter, ControlWordTellsScopeAndLife) {
  const struct {
    bool permanent;
    bool global;
    const char* text;
  } rows[] = {{false, false, "pParamStr:[log_level=1], Ccw:[0]"},
              {true, false, "pParamStr:[log_level=1], Ccw:[1]"},
              {false, true, "pParamStr:[log_level=1], Ccw:[2]"},
              {true, true, "pParamStr:[log_level=1], Ccw:[3]"}};
  for (const auto& row : rows) {
    call("log_level", "1", row.permanent, row.global);
    EXPECT_EQ(log.count(row.text), 1u) << row.text;
  }
}

TEST_F(Set_Driver_Parameter, FailureOfTheLibraryIsItsStatusAboveFortyThousand) {
  EXPECT_EQ(call("no_such_parameter", "1"), 40001u);
  EXPECT_EQ(log.level("RM_SetDriverParam fails with status : 1"), TVX_ERR);
  EXPECT_EQ(log.level("TVXHBA_FCHBADriverParamService_Provider::tvxcimSetDriverParam failed"),
            TVX_ERR);
  addFault(R"({"call": "LRM_SetDriverParam", "status": 148})");
  EXPECT_EQ(call("depth", "1"), 40148u);
}

TEST_F(Set_Driver_Parameter, MissingTextsAreRefused) {
  EXPECT_EQ(call(nullptr, "1"), 40001u);
  EXPECT_EQ(log.level("Null pointer assignment in argument pDriverParam"), TVX_ERR);
  EXPECT_EQ(call("depth", nullptr), 40001u);
  EXPECT_EQ(log.level("Null pointer assignment in argument pVal"), TVX_ERR);
  EXPECT_EQ(tvxsim_calls("LRM_SetDriverParam", nullptr), 0u);
}

TEST_F(Set_Driver_Parameter, ControlWordsBeyondOneAreRefused) {
  HBA_WWN wwpn{{0x10, 0, 0, 0, 0, 0, 0, 0xA1}};
  EXPECT_EQ(TVX_MethodWrapper::tvxcimSetDriverParam(FIRST, &wwpn, 2, 0, "depth", "1"), 1);
  EXPECT_EQ(log.level("INVALID CW1"), TVX_ERR);
  EXPECT_EQ(TVX_MethodWrapper::tvxcimSetDriverParam(FIRST, &wwpn, 0, 2, "depth", "1"), 1);
  EXPECT_EQ(log.level("INVALID CW2"), TVX_ERR);
  wwpn.wwn[7] = 0xFF;
  EXPECT_EQ(TVX_MethodWrapper::tvxcimSetDriverParam(FIRST, &wwpn, 0, 0, "depth", "1"), 1);
  EXPECT_EQ(log.level("INVALID wwpn"), TVX_ERR);
  EXPECT_EQ(tvxsim_calls("LRM_SetDriverParam", nullptr), 0u);
}

TEST_F(Set_Driver_Parameter, FirstOfSeveralMistakesIsTold) {
  HBA_WWN wwpn{{0x10, 0, 0, 0, 0, 0, 0, 0xFF}};
  const std::vector<std::string> texts = {"INVALID wwpn", "INVALID CW1", "INVALID CW2",
                                          "Null pointer assignment in argument pDriverParam",
                                          "Null pointer assignment in argument pVal"};
  const auto mistakes = [&](std::uint32_t cw1, std::uint32_t cw2, const char* parameter) {
    log.clear();
    EXPECT_EQ(TVX_MethodWrapper::tvxcimSetDriverParam(FIRST, &wwpn, cw1, cw2, parameter, nullptr),
              1);
    return log.only(texts);
  };
  using Texts = std::vector<std::string>;
  EXPECT_EQ(mistakes(2, 2, nullptr), Texts{texts[0]});
  wwpn.wwn[7] = 0xA1;
  EXPECT_EQ(mistakes(2, 2, nullptr), Texts{texts[1]});
  EXPECT_EQ(mistakes(1, 2, nullptr), Texts{texts[2]});
  EXPECT_EQ(mistakes(1, 1, nullptr), Texts{texts[3]});
  EXPECT_EQ(mistakes(1, 1, "depth"), Texts{texts[4]});
}

#ifndef NDEBUG  // locks are only booked in debug builds
TEST_F(Set_Driver_Parameter, LibraryIsCalledUnderTheDataLock) {
  Lock_Witness witness("Calling RM_SetDriverParam");
  EXPECT_EQ(call("depth", "64"), 0u);
  EXPECT_TRUE(witness.wasHeld);
}
#endif

TEST_F(Set_Driver_Parameter, LongTextsAreCutToTheirRoom) {
  const std::string value(300, '7');
  call("depth", value.c_str());
  EXPECT_EQ(log.count("pParamStr:[depth=" + std::string(249, '7') + "], Ccw:[0]"), 1u);
}

TEST_F(Set_Driver_Parameter, UnknownServiceIsRefused) {
  const Ref<TVXHBA_FCHBADriverParamService> other(TVXHBA_FCHBADriverParamService::create());
  other->Name.set("another");
  service = other.get();
  EXPECT_EQ(call("depth", "1"), 33068u);
  EXPECT_EQ(log.level("Invalid instance of HBA Driver Parameter Service"), TVX_ERR);
  const TVXHBA_FCPort* port = target;
  target = nullptr;
  EXPECT_EQ(call("depth", "1"), 33068u) << "the service comes before the port";
  target = port;
  agent->m_TVXHBA_FCHBADriverParamService_map.clear();
  EXPECT_EQ(call("depth", "1"), 0u);
}

TEST_F(Set_Driver_Parameter, TargetMustBeAKnownPort) {
  target = nullptr;
  EXPECT_EQ(call("depth", "1"), 32968u);
  EXPECT_EQ(log.level("TVXHBA_FCHBADriverParamService_Provider SetDriverParameter invald fc port "
                      "...return"),
            TVX_ERR);
  const Ref<TVXHBA_FCPort> other(TVXHBA_FCPort::create());
  other->DeviceID.set("10000000000000FF");
  target = other.get();
  EXPECT_EQ(call("depth", "1"), 32968u);
  EXPECT_EQ(log.level("Could not find the passed FCPort in the map"), TVX_ERR);
  EXPECT_EQ(log.level("TVXHBA_FCHBADriverParamService_Provider invald fc port ...return"), TVX_ERR);
  log.clear();
  const Ref<TVXHBA_Chip> chip(TVXHBA_Chip::create());
  target = reinterpret_cast<const TVXHBA_FCPort*>(chip.get());
  EXPECT_EQ(call("depth", "1"), 32968u);
  EXPECT_EQ(log.count("Checking the FCPort"), 0u);
  EXPECT_EQ(log.level("TVXHBA_FCHBADriverParamService_Provider invald fc port ...return"), TVX_ERR);
  EXPECT_EQ(tvxsim_calls("LRM_SetDriverParam", nullptr), 0u);
}

TEST_F(Set_Driver_Parameter, PortWhoseNameCannotBeConvertedIsUnknown) {
  agent->m_TVXHBA_FCPort_map[0]->DeviceID.set("nonsense");
  EXPECT_EQ(call("depth", "1"), 32968u);
  EXPECT_EQ(log.level("str2HBAName failed"), TVX_ERR);
}

}  // namespace
}  // namespace cimrt::test
