// The programs in the flash of a port.
#include "../agent/Agent_Fixture.h"
#include "../agent/Instance_Checks.h"
#include "common/TVX_Clock.h"
#include "model/TVX_Data.h"
#include "services/TVX_FlashImage.h"

namespace cimrt::test {
namespace {

using Image = TVXHBA_FlashImageSoftwareIdentity;

constexpr const char* PORT = "1000000000000001";

class Flash_Images : public Agent_Test {
 protected:
  ProviderAgent& build(const std::string& flash, const std::string& faults = "[]") {
    useScenario(R"({"cards": [{"model": "TVX1", "manufacturer": "Maker", "ports": [
        {"wwpn": "10:00:00:00:00:00:00:01", "flash": )" +
                flash + R"(}]}], "faults": )" + faults + "}");
    ProviderAgent& agent = startAgent();
    refresh(agent);
    return agent;
  }

  static constexpr const char* TWO =
      R"([{"start": 131072, "length": 4096, "id": 11, "id2": 12, "description": "Initial Load",
           "type": "LOAD", "version": "2.01a4", "wakeup": true},
          {"start": 262144, "length": 8192, "id": 21, "id2": 22, "description": "Boot Code",
           "type": "BOOT", "version": "unreadable"}])";
};

TEST_F(Flash_Images, EveryProgramHasItsInstance) {
  ProviderAgent& agent = build(TWO);
  ASSERT_EQ(agent.m_TVXHBA_FlashImageSoftwareIdentity_map.size(), 2u);
  const Image& image = *agent.m_TVXHBA_FlashImageSoftwareIdentity_map[0];
  EXPECT_TRUE(image.__name_space == "root/torvex");
  EXPECT_EQ(textOf(image.InstanceID), "FC HBA Flash Image LOAD v 2.01a4 TVX1 1000000000000001");
  EXPECT_EQ(textOf(image.ElementName), "FC HBA Flash Image LOAD v 2.01a4 TVX1 1000000000000001");
  EXPECT_EQ(textOf(image.Manufacturer), "Maker");
  EXPECT_EQ(textOf(image.Description), "Initial Load");
  EXPECT_EQ(textOf(image.ProgramType), "LOAD");
  EXPECT_EQ(textOf(image.Name), "LOAD");
  EXPECT_EQ(textOf(image.VersionString), "2.01a4");
  EXPECT_EQ(numberOf(image.StartAddress), 131072);
  EXPECT_EQ(numberOf(image.ProgramLength), 4096);
  EXPECT_EQ(numbersOf(image.ProgramID), (std::vector<std::uint32_t>{11, 12}));
  EXPECT_EQ(numberOf(image.Next), 1);
  EXPECT_EQ(numberOf(image.Previous), 0);
  EXPECT_EQ(numberOf(image.IsWakeupParameter), 1);
  EXPECT_EQ(numberOf(image.MajorVersion), 2);
  EXPECT_EQ(numberOf(image.MinorVersion), 0);
  EXPECT_EQ(numberOf(image.RevisionNumber), 1);
  EXPECT_EQ(numberOf(image.BuildNumber), 4);
  EXPECT_EQ(textOf(image.ReleaseType), "a");
  EXPECT_EQ(textOf(image.TestReleaseVersion), "");
  EXPECT_EQ(numbersOf(image.Classifications), (std::vector<std::uint16_t>{10}));
  EXPECT_EQ(textsOf(image.ClassificationDescriptions),
            (std::vector<std::string>{"Firmware Kernel"}));
  EXPECT_EQ(numberOf(image.IsEntity), 1);
  EXPECT_EQ(textsOf(image.IdentityInfoValue), (std::vector<std::string>{"Initial Load", "2.01a4"}));
  EXPECT_EQ(textsOf(image.IdentityInfoType),
            (std::vector<std::string>{"TORVEX:FLASH_PROGRAM_TYPE", "TORVEX:FLASH_PROGRAM_ID"}));
  EXPECT_EQ(image.ReleaseDate.value.usec(), tvxNow());
}

TEST_F(Flash_Images, VersionThatCannotBeReadLeavesItsNumbersNull) {
  ProviderAgent& agent = build(TWO);
  const Image& image = *agent.m_TVXHBA_FlashImageSoftwareIdentity_map[1];
  EXPECT_EQ(textOf(image.VersionString), "unreadable");
  EXPECT_EQ(numberOf(image.MajorVersion), -1);
  EXPECT_EQ(textOf(image.ReleaseType), "(null)");
  EXPECT_EQ(numberOf(image.IsWakeupParameter), 0);
  EXPECT_EQ(log.count("FlashContentsInstance - Parsing VersionString"), 2u);
  EXPECT_EQ(log.count("FlashContentsInstance - Parsing Success"), 1u);
  EXPECT_EQ(log.count("FlashContentsInstance - Parsing Done"), 2u);
  EXPECT_EQ(log.count("Generating TVXHBA_FlashImageSoftwareIdentity."), 1u);
  EXPECT_EQ(log.level("Success..."), TVX_DBG);
}

TEST_F(Flash_Images, ProgramsAreTiedToThePort) {
  ProviderAgent& agent = build(TWO);
  auto& map = agent.m_TVXHBA_ElementFlashImageSoftwareIdentity_map;
  ASSERT_EQ(map.size(), 2u);
  EXPECT_TRUE(tiesClones(map[1], agent.m_TVXHBA_FlashImageSoftwareIdentity_map[1],
                         agent.m_TVXHBA_FCPort_map[0]));
  EXPECT_EQ(numberOf(map[1]->UpgradeCondition), 3);
  EXPECT_EQ(numbersOf(map[1]->ElementSoftwareStatus), (std::vector<std::uint16_t>{6}));
}

TEST_F(Flash_Images, EmptyFlash) {
  ProviderAgent& agent = build("[]");
  EXPECT_EQ(agent.m_TVXHBA_FlashImageSoftwareIdentity_map.size(), 0u);
  EXPECT_EQ(agent.m_TVXHBA_FCPort_map.size(), 1u);
}

TEST_F(Flash_Images, FailedReadIsNoFailureOfTheBuild) {
  ProviderAgent& agent = build(TWO, R"([{"call": "LRM_DiagGetLoadListParams", "status": 9}])");
  EXPECT_EQ(agent.m_TVXHBA_FlashImageSoftwareIdentity_map.size(), 0u);
  EXPECT_EQ(log.count("Failed to retrieve the flash contents. Exited with ErrorCode 9"), 1u);
  EXPECT_EQ(agent.m_TVXHBA_ControlledBy_map.size(), 1u);
}

TEST_F(Flash_Images, CountBeyondTheListIsNotBelieved) {
  ProviderAgent& agent =
      build(TWO, R"([{"call": "LRM_DiagGetLoadListParams", "returned_size": 4000000000}])");
  // Behind the two programs the list is cleared: the second cleared entry equals the first.
  EXPECT_EQ(agent.m_TVXHBA_FlashImageSoftwareIdentity_map.size(), 3u);
  EXPECT_EQ(log.level("Insert Failed : m_TVXHBA_FlashImageSoftwareIdentity_map "), TVX_CRIT);
  EXPECT_EQ(agent.m_TVXHBA_ControlledBy_map.size(), 1u);
}

TEST_F(Flash_Images, EqualProgramsEndTheReading) {
  ProviderAgent& agent = build(
      R"([{"type": "LOAD", "version": "2.01a4", "count": 2}, {"type": "X", "version": "2.01a4"}])");
  EXPECT_EQ(agent.m_TVXHBA_FlashImageSoftwareIdentity_map.size(), 1u);
  EXPECT_EQ(log.count("Insert Failed : m_TVXHBA_FlashImageSoftwareIdentity_map "), 1u);
}

TEST_F(Flash_Images, RefusedAssociationEndsTheReading) {
  ProviderAgent& agent = build(TWO);
  const FCAdapterAttributes& attributes =
      dynamic_cast<const FCAdapterAttributes&>(*agent.m_pData->m_Adapters.at(0)->getAttributes());
  agent.m_TVXHBA_FlashImageSoftwareIdentity_map.clear();
  log.clear();
  EXPECT_EQ(CreateFlashImageIdentity(agent, PORT, attributes, agent.m_TVXHBA_FCPort_map[0]), 1);
  EXPECT_EQ(log.level("Insert Failed : m_TVXHBA_ElementFlashImageSoftwareIdentityInst_map "),
            TVX_CRIT);
  EXPECT_EQ(agent.m_TVXHBA_FlashImageSoftwareIdentity_map.size(), 1u);
}

TEST_F(Flash_Images, WithoutAnElementNothingIsTied) {
  ProviderAgent& agent = build(TWO);
  const FCAdapterAttributes& attributes =
      dynamic_cast<const FCAdapterAttributes&>(*agent.m_pData->m_Adapters.at(0)->getAttributes());
  agent.m_TVXHBA_FlashImageSoftwareIdentity_map.clear();
  EXPECT_EQ(CreateFlashImageIdentity(agent, PORT, attributes, nullptr), 0);
  EXPECT_EQ(agent.m_TVXHBA_FlashImageSoftwareIdentity_map.size(), 2u);
  EXPECT_EQ(log.count("Failed to create ElementFlashImageSoftwareIdentityInst"), 2u);
}

TEST_F(Flash_Images, InvalidNameIsRefused) {
  ProviderAgent& agent = build("[]");
  const FCAdapterAttributes& attributes =
      dynamic_cast<const FCAdapterAttributes&>(*agent.m_pData->m_Adapters.at(0)->getAttributes());
  EXPECT_EQ(CreateFlashImageIdentity(agent, "odd", attributes, nullptr), 1);
  EXPECT_EQ(log.level("str2HBAName failed"), TVX_ERR);
}

}  // namespace
}  // namespace cimrt::test
