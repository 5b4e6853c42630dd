// The beacon of a port: what its states are called, and what they mean.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "access/TVX_MethodWrapper.h"
#include "support/Fake_Libraries.h"
#include "support/Log_Capture.h"

namespace cimrt {
namespace {

constexpr const char* PORT = "1000000000000041";

class Beacon : public testing::Test {
 protected:
  void SetUp() override { libraries.load(); }
  void provideState(std::uint32_t answer) {
    libraries.provide(LRM_DiagBeaconState, [=](HBA_WWN wwpn, std::uint32_t* state) {
      EXPECT_EQ(wwpn.wwn[7], 0x41);
      *state = answer;
      return RM_OK;
    });
  }
  tvx::test::Fake_Libraries libraries;
  tvx::test::Log_Capture capture;
};

TEST_F(Beacon, StatesAreNamedAndBecomeIndicators) {
  const struct {
    std::uint32_t state;
    std::uint16_t indicator;  // 77 is left as it was
    const char* text;
  } rows[] = {{0, 77, "Beacon state = 'Unknown'\n"},
              {1, 77, "Beacon state = 'Not available'\n"},
              {2, 3, "Beacon state = 'Off'\n"},
              {3, 2, "Beacon state = 'On'\n"},
              {4, 77, "Beacon state = 'Unknown'\n"}};
  for (const auto& row : rows) {
    provideState(row.state);
    capture.forget();
    std::uint16_t indicator = 77;
    EXPECT_EQ(TVX_MethodWrapper::GetBeaconState(PORT, &indicator), 0);
    EXPECT_EQ(indicator, row.indicator) << row.state;
    EXPECT_TRUE(capture.has(5, "TVX_DiagTestFunc::GetBeaconState"));
    EXPECT_TRUE(capture.has(5, row.text)) << row.state;
  }
}

TEST_F(Beacon, LibraryWithoutItTellsNothing) {
  std::uint16_t indicator = 77;
  EXPECT_EQ(TVX_MethodWrapper::GetBeaconState(PORT, &indicator), 0);
  EXPECT_EQ(indicator, 0);
  EXPECT_TRUE(capture.has(5, "Unable to get the beacon state"));
}

TEST_F(Beacon, IndicatorsBecomeStates) {
  std::vector<std::uint32_t> states;
  libraries.provide(LRM_DiagBeacon, [&](HBA_WWN, std::uint32_t state) {
    states.push_back(state);
    return RM_OK;
  });
  const HBA_WWN wwpn = {{0x10, 0, 0, 0, 0, 0, 0, 0x41}};
  EXPECT_EQ(TVX_MethodWrapper::SetBeaconState(wwpn, 2), 0);
  EXPECT_EQ(TVX_MethodWrapper::SetBeaconState(wwpn, 3), 0);
  EXPECT_EQ(TVX_MethodWrapper::SetBeaconState(wwpn, 0), 0x80C8);
  EXPECT_EQ(TVX_MethodWrapper::SetBeaconState(wwpn, 4), 0x80C8);
  EXPECT_THAT(states, testing::ElementsAre(3U, 2U));
  EXPECT_EQ(capture.count(5, "Successfully set the beacon state"), 2U);
}

}  // namespace
}  // namespace cimrt
