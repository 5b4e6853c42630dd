// The job of a run: what it tells, what it is tied to, and how it goes.
#include <set>

#include "Diagnostics_Fixture.h"
#include "common/TVX_Clock.h"

namespace cimrt::test {
namespace {

const Meta_Class* unmakeable = nullptr;
Instance* makeAllButOne(const Meta_Class* metaClass) {
  return metaClass == unmakeable ? nullptr : create(metaClass, true);
}

class Jobs : public Diagnostics_Test {
 protected:
  void SetUp() override {
    Diagnostics_Test::SetUp();
    build();
  }
  TVXHBA_ConcreteJob* makeJob(std::uint32_t state, bool deleteOnCompletion = false) {
    Property<bool> flag{deleteOnCompletion, 0};
    return TVX_Diagnostics(*agent).CreateConcreteJobInstantiateNonBlocking(SELF_TEST, flag, state,
                                                                           9, controller());
  }
  /// The number in the name of a job.
  static int numberIn(const std::string& id) {
    const std::string head = std::string(SELF_TEST) + ":";
    EXPECT_EQ(id.substr(0, head.size()), head);
    return std::stoi(id.substr(head.size()));
  }
};

TEST_F(Jobs, JobTellsHowItsTestEnded) {
  const TVXHBA_ConcreteJob& good = *makeJob(7);
  EXPECT_EQ(textOf(good.InstanceID), std::string(SELF_TEST) + ":" +
                                         std::to_string(numberIn(textOf(good.InstanceID))) + ":9");
  EXPECT_EQ(textOf(good.ElementName), "TVXHBA_ConcreteJob");
  EXPECT_EQ(textOf(good.Name), SELF_TEST);
  EXPECT_EQ(numberOf(good.DeleteOnCompletion), 0);
  EXPECT_EQ(numberOf(good.JobState), 7);
  EXPECT_EQ(numberOf(good.PercentComplete), 100);
  EXPECT_TRUE(good.TimeSubmitted.value.equal(tvxNowDatetime())) << "the end of the test";
  EXPECT_TRUE(good.ElapsedTime.value.equal(tvxNowDatetime())) << "a time, and no length";
  EXPECT_EQ(filledIn(&good),
            (std::set<std::string>{"InstanceID", "ElementName", "Name", "DeleteOnCompletion",
                                   "TimeSubmitted", "ElapsedTime", "JobState", "PercentComplete"}))
      << "the rest stays unset";
  EXPECT_TRUE(good.__name_space == "root/torvex");
  const TVXHBA_ConcreteJob& bad = *makeJob(0x8000);
  EXPECT_EQ(numberOf(bad.JobState), 10);
  EXPECT_EQ(numberOf(bad.PercentComplete), 0);
  EXPECT_EQ(log.count("CreateConcreteJobInstantiateNonBlocking"), 2u);
  EXPECT_EQ(log.level("CreateConcreteJobInstantiateNonBlocking"), TVX_DBG);
}

TEST_F(Jobs, JobsAreNumbered) {
  const int first = numberIn(textOf(makeJob(7)->InstanceID));
  EXPECT_EQ(numberIn(textOf(makeJob(7)->InstanceID)), first + 1);
}

TEST_F(Jobs, JobIsTiedToItsTestAndToItsPort) {
  const TVXHBA_ConcreteJob* job = makeJob(7);
  ASSERT_EQ(agent->m_TVXHBA_OwningJobElement_map.size(), 1u);
  EXPECT_TRUE(tiesClones(agent->m_TVXHBA_OwningJobElement_map[0], test(SELF_TEST), job));
  ASSERT_EQ(agent->m_TVXHBA_AffectedJobElement_map.size(), 1u);
  EXPECT_TRUE(tiesClones(agent->m_TVXHBA_AffectedJobElement_map[0], controller(), job));
}

TEST_F(Jobs, JobsOfTestsWithoutIdentifierSayFFFF) {
  for (const char* name : {STATUS_TEST, RESET_TEST, BEACON_TEST}) {
    const std::string id = textOf(run(name).job->InstanceID);
    EXPECT_EQ(id.substr(id.rfind(':')), ":65535") << name;
  }
  const std::string id = textOf(run(SELF_TEST).job->InstanceID);
  EXPECT_EQ(id.substr(id.rfind(':')), ":1");
}

TEST_F(Jobs, JobsThatCantBeMadeOrInsertedAreTold) {
  setDiagnosticFactory(makeAllButOne);
  unmakeable = &TVXHBA_ConcreteJob::static_meta_class;
  EXPECT_EQ(makeJob(7), nullptr);
  EXPECT_EQ(log.level("Unable to create TVXHBA_ConcreteJob"), TVX_ERR);
  unmakeable = nullptr;
  const int number = numberIn(textOf(makeJob(7)->InstanceID));
  Ref<TVXHBA_ConcreteJob> inTheWay(clone(agent->m_TVXHBA_ConcreteJob_map[0]));
  inTheWay->InstanceID.set(
      (std::string(SELF_TEST) + ":" + std::to_string(number + 1) + ":9").c_str());
  agent->m_TVXHBA_ConcreteJob_map.insert(inTheWay.release());
  EXPECT_EQ(makeJob(7), nullptr);
  EXPECT_EQ(log.level("Insert Failed: TVXHBA_ConcreteJob"), TVX_CRIT);
}

TEST_F(Jobs, TiesOfAJobThatFailAreToldAndTheJobStands) {
  setDiagnosticFactory(makeAllButOne);
  const struct {
    const Meta_Class* part;
    const char* text;
  } parts[] = {
      {&TVXHBA_OwningJobElement::static_meta_class, "Unable to create TVXHBA_OwningJobElement"},
      {&TVXHBA_AffectedJobElement::static_meta_class,
       "Unable to create TVXHBA_AffectedJobElement"}};
  for (const auto& row : parts) {
    unmakeable = row.part;
    EXPECT_NE(makeJob(7), nullptr);
    EXPECT_EQ(log.level(row.text), TVX_ERR);
  }
  EXPECT_EQ(agent->m_TVXHBA_ConcreteJob_map.size(), 2u);
  unmakeable = nullptr;
  // A job that went and comes again under its name meets its own ties.
  const TVXHBA_ConcreteJob* job = makeJob(7);
  const int number = numberIn(textOf(job->InstanceID));
  agent->m_TVXHBA_OwningJobElement_map.clear();
  agent->m_TVXHBA_AffectedJobElement_map.clear();
  Ref<TVXHBA_ConcreteJob> next(clone(job));
  next->InstanceID.set((std::string(SELF_TEST) + ":" + std::to_string(number + 1) + ":9").c_str());
  agent->m_TVXHBA_OwningJobElement_map.insert(
      makeAssociation<TVXHBA_OwningJobElement>(test(SELF_TEST), next.get()).release());
  agent->m_TVXHBA_AffectedJobElement_map.insert(
      makeAssociation<TVXHBA_AffectedJobElement>(controller(), next.get()).release());
  EXPECT_NE(makeJob(7), nullptr);
  for (const char* text :
       {"Insert Failed: TVXHBA_OwningJobElement", "Insert Failed: TVXHBA_AffectedJobElement"})
    EXPECT_EQ(log.level(text), TVX_ERR);
}

TEST_F(Jobs, DeletedJobLeavesItsTies) {
  TVX_Diagnostics diagnostics(*agent);
  EXPECT_EQ(diagnostics.DeleteConcreteJob(nullptr), 0x80C9);
  EXPECT_EQ(log.level("Invalid Job ID"), TVX_DBG);
  const TVXHBA_ConcreteJob* job = makeJob(7);
  makeJob(7);
  EXPECT_EQ(diagnostics.DeleteConcreteJob(job), 0);
  EXPECT_EQ(agent->m_TVXHBA_ConcreteJob_map.size(), 1u);
  EXPECT_EQ(agent->m_TVXHBA_OwningJobElement_map.size(), 2u);
  EXPECT_EQ(agent->m_TVXHBA_AffectedJobElement_map.size(), 2u);
  EXPECT_EQ(log.count("TVXHBA_DiagTestFunc::DeleteConcreteJob()"), 2u);
  EXPECT_EQ(log.level("TVXHBA_DiagTestFunc::DeleteConcreteJob()"), TVX_DBG);
}

}  // namespace
}  // namespace cimrt::test
