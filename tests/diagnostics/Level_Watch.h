// Holds every message of the diagnostics against its level, whatever else a test looks at.
#pragma once

#include "common/CLogger.h"

namespace cimrt::test {

/// A back end of the logger. A message that comes from the diagnostics' own code at another level
/// than it should fails the test that runs.
class Level_Watch : public TVX_LoggerInterface {
 public:
  void log(int level, const char* file, const unsigned* line, const char* text) override;
  void open() override {}
  void close() override {}
  void clear() override {}
};

}  // namespace cimrt::test
