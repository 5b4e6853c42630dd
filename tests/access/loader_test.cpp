#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cstdio>
#include <string>

#include "access/TVX_Runtime_Loader.h"
#include "support/Fake_Libraries.h"
#include "support/Log_Capture.h"

namespace cimrt {
namespace {

using testing::ElementsAre;
using tvx::test::Fake_Libraries;
using tvx::test::Log_Capture;
using tvx::test::Logged;
using Lookup = Fake_Libraries::Lookup;

class Loader : public testing::Test {
 protected:
  Fake_Libraries libraries;
  Log_Capture capture;
};

// ---- Load ----

TEST_F(Loader, OpensThePresentNamesAndStops) {
  libraries.with("HBAAPI.so.2").with("liblrmapi.so").with("librmapi.so");
  EXPECT_EQ(LoadRuntimeLibraries(), 0);
  EXPECT_THAT(libraries.opens, ElementsAre("HBAAPI.so.2", "liblrmapi.so"));
  EXPECT_EQ(runtimeLibraryHandle(TVX_SLOT_RMAPI), nullptr);
  EXPECT_EQ(runtimeLibraryHandle(TVX_SLOT_SDM), nullptr);
  EXPECT_EQ(HbaApiUnavailable + LrmApiUnavailable + RmApiUnavailable, 0);
  EXPECT_TRUE(capture.lines().empty());
}

TEST_F(Loader, TakesTheOtherSniaNameSecond) {
  libraries.with("HBAAPI.so").with("liblrmapi.so");
  EXPECT_EQ(LoadRuntimeLibraries(), 0);
  EXPECT_THAT(libraries.opens, ElementsAre("HBAAPI.so.2", "HBAAPI.so", "liblrmapi.so"));
  EXPECT_EQ(HbaApiUnavailable, 0);
  EXPECT_THAT(capture.lines(), ElementsAre(Logged{TVX_ERR, "dlopen failed :no such library"}));
}

TEST_F(Loader, AnswersOneWhenTheOlderNameStandsIn) {
  libraries.with("librmapi.so");
  EXPECT_EQ(LoadRuntimeLibraries(), 1);
  EXPECT_EQ(HbaApiUnavailable, 1);
  EXPECT_EQ(LrmApiUnavailable, 1);
  EXPECT_EQ(RmApiUnavailable, 0);
}

TEST_F(Loader, ATotalFailureIsSilentToTheCaller) {
  EXPECT_EQ(LoadRuntimeLibraries(), 0);
  EXPECT_EQ(HbaApiUnavailable + LrmApiUnavailable + RmApiUnavailable, 3);
  EXPECT_TRUE(isSdmAvailable());
  EXPECT_EQ(capture.count(TVX_ERR, "dlopen failed :no such library"), 4U);
  EXPECT_EQ(LRM_ResetHBA(HBA_WWN{}, 1), 1);
  EXPECT_EQ(HBA_OpenAdapter(nullptr), 1U);
  EXPECT_TRUE(libraries.lookups.empty());
}

TEST_F(Loader, AnAbsentErrorTextIsEmpty) {
  libraries.errorText = nullptr;
  EXPECT_EQ(OpenRuntimeLibrary(1, "lrmapi"), 0);
  EXPECT_TRUE(capture.has(TVX_ERR, "dlopen failed :"));
}

TEST_F(Loader, AFilledSlotIsNotOpenedAgain) {
  libraries.with("liblrmapi.so");
  EXPECT_EQ(OpenRuntimeLibrary(TVX_SLOT_LRMAPI, "lrmapi"), 1);
  EXPECT_EQ(OpenRuntimeLibrary(TVX_SLOT_LRMAPI, "other"), 1);
  EXPECT_THAT(libraries.opens, ElementsAre("liblrmapi.so"));
}

TEST_F(Loader, NamesThatBeginWithHbaAreKept) {
  OpenRuntimeLibrary(0, "HBAxyz");
  OpenRuntimeLibrary(0, "hbaapi");
  OpenRuntimeLibrary(0, "HB");
  EXPECT_THAT(libraries.opens, ElementsAre("HBAxyz", "libhbaapi.so", "libHB.so"));
}

TEST_F(Loader, SlotsAndNamesOutsideTheTableAreRefused) {
  EXPECT_EQ(OpenRuntimeLibrary(-1, "lrmapi"), 0);
  EXPECT_EQ(OpenRuntimeLibrary(4, "lrmapi"), 0);
  EXPECT_EQ(OpenRuntimeLibrary(0, nullptr), 0);
  EXPECT_EQ(runtimeLibraryHandle(-1), nullptr);
  EXPECT_EQ(runtimeLibraryHandle(4), nullptr);
  EXPECT_EQ(resolveEntryPoint(entry_points::COUNT), nullptr);
  EXPECT_EQ(resolveEntryPoint(entry_points::COUNT - 1), nullptr);  // a row without a name
  EXPECT_TRUE(libraries.opens.empty());
  EXPECT_TRUE(libraries.lookups.empty());
}

// ---- Unload ----

TEST_F(Loader, UnloadsInTheOrderOfTheSlots) {
  libraries.with("librmapi.so").with("HBAAPI.so.2");
  LoadRuntimeLibraries();
  EXPECT_EQ(UnloadRuntimeLibraries(), 0);
  EXPECT_THAT(libraries.closes, ElementsAre("HBAAPI.so.2", "librmapi.so"));
  EXPECT_EQ(UnloadRuntimeLibraries(), 0);  // nothing is open any more
  EXPECT_EQ(libraries.closes.size(), 2U);
}

TEST_F(Loader, AFailedCloseIsLoggedAndDoesNotStopTheWalk) {
  libraries.load();
  char handle[40];
  std::snprintf(handle, sizeof handle, "%p", runtimeLibraryHandle(TVX_SLOT_HBAAPI));
  libraries.closeResult = 1;
  libraries.errorText = "busy";
  EXPECT_EQ(UnloadRuntimeLibraries(), 0);
  EXPECT_TRUE(
      capture.has(TVX_ERR, "dlclose for lib " + std::string(handle) + " failed with busy\n"));
  EXPECT_EQ(libraries.closes.size(), 2U);
  EXPECT_EQ(runtimeLibraryHandle(TVX_SLOT_HBAAPI), nullptr);
  EXPECT_EQ(runtimeLibraryHandle(TVX_SLOT_LRMAPI), nullptr);
}

TEST_F(Loader, UnloadForgetsFlagsAndFunctions) {
  libraries.provide(LRM_InitLib, [] { return 5; });
  libraries.load();
  EXPECT_EQ(LRM_InitLib(), 5);
  UnloadRuntimeLibraries();
  EXPECT_EQ(HbaApiUnavailable + LrmApiUnavailable + RmApiUnavailable, 0);
  libraries.remove("LRM_InitLib");
  LoadRuntimeLibraries();
  EXPECT_EQ(LRM_InitLib(), 1);
}

// ---- Stub rule ----

TEST_F(Loader, AFoundFunctionIsLookedUpOnce) {
  libraries.provide(LRM_InitLib, [] { return 7; });
  libraries.load();
  EXPECT_EQ(LRM_InitLib(), 7);
  EXPECT_EQ(LRM_InitLib(), 7);
  EXPECT_THAT(libraries.lookups, ElementsAre(Lookup{"liblrmapi.so", "LRM_InitLib"}));
}

TEST_F(Loader, AMissingFunctionIsLookedUpOnEveryCallUnderOneName) {
  libraries.load();
  EXPECT_EQ(LRM_InitLib(), 1);
  EXPECT_EQ(LRM_InitLib(), 1);
  const Lookup once{"liblrmapi.so", "LRM_InitLib"};
  EXPECT_THAT(libraries.lookups, ElementsAre(once, once));
  libraries.provide(LRM_InitLib, [] { return 0; });
  EXPECT_EQ(LRM_InitLib(), 0);
}

TEST_F(Loader, TheOlderLibraryIsAskedOnEveryCallUnderBothNames) {
  libraries.with("librmapi.so");
  ASSERT_EQ(LoadRuntimeLibraries(), 1);
  libraries.provideAs("RM_InitLib", LRM_InitLib, [] { return 9; });
  EXPECT_EQ(LRM_InitLib(), 9);
  EXPECT_EQ(LRM_InitLib(), 9);
  const Lookup first{"librmapi.so", "LRM_InitLib"};
  const Lookup second{"librmapi.so", "RM_InitLib"};
  EXPECT_THAT(libraries.lookups, ElementsAre(first, second, first, second));
  // The cached pointer is never consulted: a function that went away is missing at once.
  libraries.remove("RM_InitLib");
  EXPECT_EQ(LRM_InitLib(), 1);
}

TEST_F(Loader, TheOlderLibrarysLongerNameComesFirst) {
  libraries.with("librmapi.so");
  LoadRuntimeLibraries();
  libraries.provide(LRM_InitLib, [] { return 3; });
  EXPECT_EQ(LRM_InitLib(), 3);
  EXPECT_THAT(libraries.lookups, ElementsAre(Lookup{"librmapi.so", "LRM_InitLib"}));
}

TEST_F(Loader, RouteTablesAreLookedUpTwiceUnderTheSameName) {
  libraries.with("librmapi.so");
  LoadRuntimeLibraries();
  EXPECT_EQ(resolveEntryPoint(entry_points::find("LRM_Ini_GetRouteTable")), nullptr);
  const Lookup same{"librmapi.so", "LRM_Ini_GetRouteTable"};
  EXPECT_THAT(libraries.lookups, ElementsAre(same, same));
}

TEST_F(Loader, TheBoardNumberHasOneName) {
  libraries.with("librmapi.so");
  LoadRuntimeLibraries();
  EXPECT_EQ(resolveEntryPoint(entry_points::find("TvxGetBoardNumber")), nullptr);
  const Lookup same{"librmapi.so", "TvxGetBoardNumber"};
  EXPECT_THAT(libraries.lookups, ElementsAre(same, same));
}

TEST_F(Loader, SniaFunctionsComeFromTheirOwnLibrary) {
  libraries.provide(HBA_GetNumberOfAdapters, [] { return HBA_UINT32{4}; });
  libraries.load();
  EXPECT_EQ(HBA_GetNumberOfAdapters(), 4U);
  EXPECT_THAT(libraries.lookups, ElementsAre(Lookup{"HBAAPI.so.2", "HBA_GetNumberOfAdapters"}));
}

TEST_F(Loader, WithoutTheSniaLibraryTheDefaultScopeIsAskedTwice) {
  libraries.with("liblrmapi.so");
  LoadRuntimeLibraries();
  EXPECT_EQ(HBA_GetNumberOfAdapters(), 0U);
  const Lookup global{"", "HBA_GetNumberOfAdapters"};
  EXPECT_THAT(libraries.lookups, ElementsAre(global, global));
}

TEST_F(Loader, TaggingFunctionsAreLookedUpInTheDefaultScope) {
  libraries.load();
  libraries.provide(CPQFC_GetNumberOfAdapters, [] { return 2U; });
  EXPECT_EQ(CPQFC_GetNumberOfAdapters(), 2U);
  EXPECT_EQ(CPQFC_FreeLibrary(), 1);
  EXPECT_THAT(libraries.lookups, ElementsAre(Lookup{"", "CPQFC_GetNumberOfAdapters"},
                                             Lookup{"", "CPQFC_FreeLibrary"}));
}

TEST_F(Loader, TheTaggingLibrarysCloseKnowsTheFallbackStepOnly) {
  libraries.load();
  HBA_HANDLE closed = 0;
  libraries.provide(CPQFC_CloseAdapter, [&](HBA_HANDLE handle) { closed += handle; });
  CPQFC_CloseAdapter(3);
  CPQFC_CloseAdapter(3);
  EXPECT_EQ(closed, 6U);
  const Lookup global{"", "CPQFC_CloseAdapter"};
  EXPECT_THAT(libraries.lookups, ElementsAre(global, global));
}

TEST_F(Loader, TheTaggingLibrarysCloseReturnsAtOnceWithoutAnyLibrary) {
  LoadRuntimeLibraries();
  libraries.provide(CPQFC_CloseAdapter, [](HBA_HANDLE) { FAIL(); });
  CPQFC_CloseAdapter(3);
  EXPECT_TRUE(libraries.lookups.empty());
}

TEST_F(Loader, ArgumentsAndResultPassUnchanged) {
  libraries.load();
  libraries.provide(LRM_SetOASLunState,
                    [](HBA_WWN initiator, HBA_WWN port, HBA_WWN target, std::uint64_t lun,
                       std::uint8_t state, std::uint32_t option) {
                      EXPECT_EQ(initiator.wwn[0], 1);
                      EXPECT_EQ(port.wwn[7], 2);
                      EXPECT_EQ(target.wwn[3], 3);
                      EXPECT_EQ(lun, 0x123456789ABCDEFU);
                      EXPECT_EQ(state, 0xFE);
                      EXPECT_EQ(option, 0xFFFFFFFFU);
                      return -17;
                    });
  EXPECT_EQ(LRM_SetOASLunState(HBA_WWN{{1}}, HBA_WWN{{0, 0, 0, 0, 0, 0, 0, 2}},
                               HBA_WWN{{0, 0, 0, 3}}, 0x123456789ABCDEF, 0xFE, 0xFFFFFFFF),
            -17);
}

TEST_F(Loader, NothingIsLoggedByStubs) {
  libraries.load();
  LRM_InitLib();
  HBA_CloseAdapter(0);
  EXPECT_TRUE(capture.lines().empty());
}

// ---- Missing values, one stub for each ----

TEST_F(Loader, MissingFunctionsGiveTheirFixedValues) {
  libraries.load();
  EXPECT_EQ(HBA_GetNumberOfAdapters(), 0U);
  EXPECT_EQ(RM_GetNumberOfLocalAdapters(), 0U);
  EXPECT_EQ(RM_GetNextVpdEntry(nullptr, nullptr, 0, nullptr, 0), nullptr);
  EXPECT_EQ(RM_GetAttributeValue(nullptr, 0, nullptr, nullptr), nullptr);
  HBA_CloseAdapter(1);
  HBA_RefreshInformation(1);
  CPQFC_CloseAdapter(1);
  EXPECT_EQ(HBA_LoadLibrary(), 1U);
  EXPECT_EQ(HBA_OpenAdapter(nullptr), 1U);
  EXPECT_EQ(RM_IsLocalHBA(HBA_WWN{}, nullptr), 1);
  EXPECT_EQ(CPQFC_OpenAdapter(nullptr), 1U);
  EXPECT_EQ(CPQFC_GetNumberOfAdapters(), 1U);
  using Board = TVX_Stub<"TvxGetBoardNumber", int()>;
  EXPECT_EQ(Board{}(), -1);
  using Fip = TVX_Stub<"LRM_CNA_FCOE_GetFIPParams", int()>;
  EXPECT_EQ(Fip{}(), 0);
}

}  // namespace
}  // namespace cimrt
