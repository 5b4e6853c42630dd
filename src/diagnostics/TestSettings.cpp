// The settings of the tests, and what a client may put over them.
#include <algorithm>
#include <cctype>
#include <cstdlib>
#include <string>

#include "access/TVX_MethodWrapper.h"
#include "agent/Map_Insert.h"
#include "common/CLogger.h"
#include "diagnostics/DiagnosticTable.h"
#include "diagnostics/TVX_Diagnostics.h"
#include "runtime/Typed_Instance.h"

namespace cimrt {

namespace {

using Settings = TVXHBA_FCHBADiagnosticSettingData;

constexpr std::uint16_t LOOP_COUNT = 3;
constexpr std::size_t MOST_CYCLE_DIGITS = 4;
constexpr int MOST_CYCLES = 4000;
constexpr std::uint32_t MOST_PATTERN_BYTES = 8;
constexpr std::size_t DEVICE_ID_LENGTH = 16;

/// Where given settings are laid over the ones that stay.
struct Override {
  const Settings& given;
  Settings& settings;
  /// What the last look at a pattern found. A pattern without a byte leaves it as it was.
  bool patternAccepted = false;
};

/// The first element, or an empty one.
template <class T>
T firstOf(const Property<Array<T>>& property) {
  return property.value.size() != 0 ? property.value[0] : T{};
}

void checkLoopControl(Override& over) {
  if (over.given.LoopControl.is_null()) return;
  const std::uint16_t value = firstOf(over.given.LoopControl);
  TVX_LOG(TVX_DBG, "Input LoopControl : %d", value);
  if (value == LOOP_COUNT)
    over.settings.LoopControl.set({value});
  else
    TVX_LOG(TVX_DBG, "Invalid LoopControl, Valid value is '3'. Using the default value");
}

bool isCycleCount(const String& text) {
  const char* digits = text.c_str();
  if (text.size() == 0 || text.size() > MOST_CYCLE_DIGITS) return false;
  if (!std::all_of(digits, digits + text.size(), [](unsigned char c) { return std::isdigit(c); }))
    return false;
  const int value = std::atoi(digits);
  return value >= 1 && value <= MOST_CYCLES;
}

void checkLoopControlParameter(Override& over) {
  if (over.given.LoopControlParameter.is_null()) return;
  const String value = firstOf(over.given.LoopControlParameter);
  TVX_LOG(TVX_DBG, "Input LoopControlParam : %s", value.c_str());
  if (isCycleCount(value))
    over.settings.LoopControlParameter.set({value});
  else
    TVX_LOG(TVX_DBG,
            "Invalid LoopControlParam, Valid value range[1-4000]. Using the default value");
}

void checkBufferSizes(Override& over) {
  if (over.given.BufferSizes.is_null()) return;
  const std::uint32_t value = firstOf(over.given.BufferSizes);
  TVX_LOG(TVX_DBG, "Input Buffer Size : %d", static_cast<int>(value));
  if (over.given.BufferSizes.value.size() != 0 && value <= MOST_PATTERN_BYTES)
    over.settings.BufferSizes.set({value});
  else
    TVX_LOG(TVX_DBG, "Invalid BufferSizes, Valid value is '<8'. Using the default value");
}

void checkBufferPattern(Override& over) {
  if (over.given.BufferPattern.is_null()) return;
  const Array<std::uint8_t>& pattern = over.given.BufferPattern.value;
  const std::uint32_t size = firstOf(over.settings.BufferSizes);
  if (pattern.size() != 0)
    over.patternAccepted = std::all_of(pattern.begin(), pattern.end(),
                                       [](std::uint8_t byte) { return std::isxdigit(byte) != 0; });
  if (!over.patternAccepted || size == 0) {
    TVX_LOG(TVX_DBG, "Invalid BufferPattern, Use hex values. Using the default value");
    return;
  }
  TVX_LOG(TVX_DBG, "Valid Pattern entered");
  Array<std::uint8_t> taken(pattern.begin(), std::min<std::size_t>(pattern.size(), size));
  taken.resize(size, 0);
  over.settings.BufferPattern.set(taken);
}

constexpr void (*CHECKS[])(Override&) = {
    checkLoopControl,
    checkLoopControlParameter,
    checkBufferSizes,
    checkBufferPattern,
};

/// Takes over what any test that sends a pattern lets a client set. The checks run twice in a row,
/// and so each of their messages comes twice.
void overridePatternSettings(const Settings& given, Settings& settings) {
  Override over{given, settings};
  if (!given.HaltOnError.is_null()) settings.HaltOnError = given.HaltOnError;
  for (int pass = 0; pass < 2; pass++)
    for (const auto check : CHECKS) check(over);
}

void overrideTargetDevice(const Settings& given, Settings& settings) {
  if (given.TargetDevice.is_null()) return;
  const String& device = given.TargetDevice.value;
  TVX_LOG(TVX_DBG, "Input TargetDevice : %s", device.c_str());
  if (device.size() != DEVICE_ID_LENGTH) return;
  char hbaName[TVX_HBA_NAME_LENGTH + 1] = {};
  if (TVX_MethodWrapper::Id2HBAName(hbaName, device.c_str()) == RM_OK) {
    settings.TargetDevice.set(device);
    return;
  }
  TVX_LOG(TVX_DBG, "getTVXHBA_FCHBADiagnosticSettingDataInstance::Id2HBAName failed");
  settings.TargetDevice.set("");
}

void overrideTargetSettings(const Settings& given, Settings& settings) {
  TVX_LOG(TVX_DBG, "Checking the Echo test targetdevice");
  if (!given.LUN.is_null())
    settings.LUN = given.LUN;
  else
    TVX_LOG(TVX_DBG, "Invalid LUN, Using the default value '0' ");
  overrideTargetDevice(given, settings);
}

bool takesOverrides(const Diagnostic_Row& row) {
  if (row.number == Diagnostic_Test::BEACON || row.sendsPattern()) return true;
  TVX_LOG(TVX_DBG, "No Override Setting Supported for test : %s", row.name);
  return false;
}

void overrideSettings(const Diagnostic_Row& row, const Settings& given, Settings& settings) {
  if (row.sendsPattern()) overridePatternSettings(given, settings);
  if (row.needsTarget()) overrideTargetSettings(given, settings);
  settings.OverridedSettingData.set(1);
}

}  // namespace

Settings* TVX_Diagnostics::getDefaultTVXHBA_FCHBADiagnosticSettingDataInstance(
    const char* testName) {
  Settings* settings =
      findByText(m_Agent.m_TVXHBA_FCHBADiagnosticSettingData_map, &Settings::InstanceID, testName);
  if (!settings) TVX_LOG(TVX_DBG, "Could not find the default setting data");
  return settings;
}

Settings* TVX_Diagnostics::getTVXHBA_FCHBADiagnosticSettingDataInstance(const Instance* given,
                                                                        const char* testName) {
  TVX_LOG(TVX_DBG, "getTVXHBA_FCHBADiagnosticSettingDataInstance");
  Settings* settings = getDefaultTVXHBA_FCHBADiagnosticSettingDataInstance(testName);
  const auto* wanted = typed<Settings>(given);
  if (!wanted) {
    TVX_LOG(TVX_DBG, "Invalid overrided Diagsetting param, default settings values are used");
    return nullptr;
  }
  if (settings && !wanted->InstanceID.value.equal(settings->InstanceID.value)) return nullptr;
  TVX_LOG(TVX_DBG, "Using the overrided values if valid, else default settings values are used");
  const Diagnostic_Row* row = findDiagnosticTest(testName);
  if (row && takesOverrides(*row) && settings) overrideSettings(*row, *wanted, *settings);
  return settings;
}

}  // namespace cimrt
