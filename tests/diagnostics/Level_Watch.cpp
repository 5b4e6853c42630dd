#include "Level_Watch.h"

#include <gtest/gtest.h>

#include <string_view>

namespace cimrt::test {

namespace {

/// The messages that are more than a trace of what is done, by how they begin.
constexpr struct {
  int level;
  std::string_view text;
} LEVELS[] = {
    {TVX_ERR, "ERROR: GetDiagnosticVersion:RM_GetHBAAttributes call failed ("},
    {TVX_ERR, "TVXHBA_DiagTestFunc::Id2HBAName failed"},
    {TVX_ERR, "Failed to create the maps for "},
    {TVX_ERR, "Failed to insert the Diag Instances into map for DiagTest "},
    {TVX_ERR, "Invalid instance: TVXHBA_FCHBADiagnosticTest"},
    {TVX_ERR, "Either ManagedElement is NULL or Invalid instance: TVXHBA_PortController"},
    {TVX_ERR, "TVXHBA_FCHBADiagnosticTest_Provider::Id2HBAName failed"},
    {TVX_ERR, "TVXHBA_FCHBADiagnosticTest_Provider::str2HBAName failed"},
    {TVX_ERR, "INVALID wwpn/Mac Address"},
    {TVX_ERR, "Unable to create TVXHBA_ConcreteJob"},
    {TVX_CRIT, "Insert Failed: TVXHBA_ConcreteJob"},
    {TVX_ERR, "Unable to create TVXHBA_OwningJobElement"},
    {TVX_ERR, "Insert Failed: TVXHBA_OwningJobElement"},
    {TVX_ERR, "Unable to create TVXHBA_AffectedJobElement"},
    {TVX_ERR, "Insert Failed: TVXHBA_AffectedJobElement"},
    {TVX_CRIT, "Insert Failed : temp_TVXHBA_LogManagesRecord_map"},
    {TVX_CRIT, "Insert Failed : TVXHBA_RecordAppliesToElement_map"},
    {TVX_CRIT, "Insert Failed : temp_TVXHBA_DiagnosticCompletionRecord_map"},
    {TVX_CRIT, "Insert Failed : temp_TVXHBA_DiagnosticServiceRecord_map"},
};

int levelOf(std::string_view text) {
  for (const auto& each : LEVELS)
    if (text.starts_with(each.text)) return each.level;
  return TVX_DBG;
}

}  // namespace

void Level_Watch::log(int level, const char* file, const unsigned*, const char* text) {
  if (std::string_view(file).find("diagnostics/") == std::string_view::npos) return;
  EXPECT_EQ(level, levelOf(text)) << text;
}

}  // namespace cimrt::test
