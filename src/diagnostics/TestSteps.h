// What the test functions use, apart from their own objects.
#pragma once

#include <cstring>

#include "access/TVX_AttributeReader.h"
#include "access/TVX_MethodWrapper.h"
#include "agent/Map_Insert.h"
#include "common/CLogger.h"
#include "common/TVX_Clock.h"
#include "diagnostics/DiagnosticTexts.h"
#include "diagnostics/Polling.h"
#include "diagnostics/TVX_DiagTestFunc.h"

namespace cimrt {

/// Formats of the tests that are polled, which differ in small ways.
struct TVX_DiagTestFunc::Poll_Texts {
  const char* poll;     ///< of the status of a poll
  const char* failure;  ///< of the test's name and the result in words
  const char* unknown;  ///< of the test's name and a number
};

/// The attributes of a port, as they are now.
class Port_View {
 public:
  /// Reads them. The library's status; a failure is logged.
  RM_STATUS read(const HBA_WWN& wwpn);
  bool isDisabled() const;
  /// True for a port that runs as an arbitrated loop or from point to point, without a fabric.
  bool hasNoFabric() const;

 private:
  std::uint32_t number(std::uint32_t key) const;

  TVX_Block m_Block;
};

}  // namespace cimrt
