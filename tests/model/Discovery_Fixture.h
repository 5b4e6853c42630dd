// A device tree that is built from a fake host.
#pragma once

#include <gtest/gtest.h>

#include <string>

#include "Fake_Host.h"
#include "common/TVX_Memory.h"
#include "model/TVX_Data.h"
#include "support/Log_Capture.h"

namespace cimrt {

class Discovery : public testing::Test {
 protected:
  void TearDown() override {
    tvxSetAllocator(nullptr);
    data.freeAllData();
    EXPECT_EQ(host.open, 0);
  }
  void build() {
    capture.forget();
    data.buildAdapterData();
  }
  /// The one adapter's attributes, after a build.
  FCAdapterAttributes& attributes() {
    build();
    return *dynamic_cast<FCAdapterAttributes*>(data.m_Adapters.at(0)->getAttributes());
  }
  FCPortAttributes& portAttributes() {
    build();
    return *dynamic_cast<FCPortAttributes*>(data.m_Ports.at(0)->getAttributes());
  }
  void expectEmpty() const {
    EXPECT_TRUE(data.m_Adapters.empty());
    EXPECT_TRUE(data.m_Ports.empty());
    EXPECT_EQ(data.m_AdapterCount, 0U);
    EXPECT_FALSE(data.m_bFCCardFound);
  }
  void expectSkipped(const std::string& reason, int index = 0) {
    build();
    EXPECT_TRUE(capture.has(TVX_ERR, reason)) << testing::PrintToString(capture.lines());
    EXPECT_TRUE(capture.has(TVX_ERR,
                            "Catch ALL error during creating adapter..., Skipping "
                            "Adapter# " +
                                std::to_string(index)));
  }

  tvx::test::Fake_Host host;
  tvx::test::Log_Capture capture;
  Data data;
};

}  // namespace cimrt
