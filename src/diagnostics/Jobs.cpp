// The job of a run, made once the run has ended.
#include "agent/Map_Insert.h"
#include "common/TVX_Clock.h"
#include "diagnostics/DiagnosticInstances.h"
#include "diagnostics/TVX_Diagnostics.h"

namespace cimrt {

namespace {

constexpr std::uint16_t JOB_STATE_COMPLETED = 7;
constexpr std::uint16_t JOB_STATE_EXCEPTION = 10;
constexpr std::uint16_t ALL_PERCENT = 100;

/// Number in the name of the next job. The data lock guards it.
std::uint32_t lastJobNumber = 0;

void fillJob(TVXHBA_ConcreteJob& job, const char* testName,
             const Property<bool>& deleteOnCompletion, std::uint32_t state,
             std::uint32_t diagnosticID) {
  const bool completed = state == JOB_COMPLETED;
  const Datetime now = tvxNowDatetime();
  job.InstanceID.set(formatText("%s:%d:%lu", testName, static_cast<int>(++lastJobNumber),
                                static_cast<unsigned long>(diagnosticID))
                         .c_str());
  job.ElementName.set(TVXHBA_ConcreteJob::static_meta_class.name);
  job.Name.set(testName);
  job.DeleteOnCompletion = deleteOnCompletion;
  job.TimeSubmitted.set(now);
  job.ElapsedTime.set(now);
  job.JobState.set(completed ? JOB_STATE_COMPLETED : JOB_STATE_EXCEPTION);
  job.PercentComplete.set(completed ? ALL_PERCENT : std::uint16_t{0});
}

void associateJob(ProviderAgent& agent, const TVXHBA_ConcreteJob* job, const char* testName,
                  const TVXHBA_PortController* element) {
  const Instance* test = findByText(agent.m_TVXHBA_FCHBADiagnosticTest_map,
                                    &TVXHBA_FCHBADiagnosticTest::Name, testName);
  insertDiagnostic(agent.m_TVXHBA_OwningJobElement_map,
                   makeDiagnosticAssociation<TVXHBA_OwningJobElement>(test, job), TVX_ERR,
                   "Unable to create TVXHBA_OwningJobElement",
                   "Insert Failed: TVXHBA_OwningJobElement");
  insertDiagnostic(agent.m_TVXHBA_AffectedJobElement_map,
                   makeDiagnosticAssociation<TVXHBA_AffectedJobElement>(element, job), TVX_ERR,
                   "Unable to create TVXHBA_AffectedJobElement",
                   "Insert Failed: TVXHBA_AffectedJobElement");
}

/// Removes the first entry whose reference is this very object.
template <class T, class Job>
void dropAssociation(Instance_Map<T>& map, Job* T::*reference, const Instance* job) {
  for (std::size_t i = 0; i < map.size(); i++) {
    if (static_cast<const Instance*>(map[i]->*reference) != job) continue;
    map.delete_instance(map[i]);
    return;
  }
}

}  // namespace

TVXHBA_ConcreteJob* TVX_Diagnostics::CreateConcreteJobInstantiateNonBlocking(
    const char* testName, const Property<bool>& deleteOnCompletion, std::uint32_t state,
    std::uint32_t diagnosticID, const TVXHBA_PortController* element) {
  TVX_LOG(TVX_DBG, "CreateConcreteJobInstantiateNonBlocking");
  Ref<TVXHBA_ConcreteJob> job = makeDiagnostic<TVXHBA_ConcreteJob>();
  if (!job) {
    TVX_LOG(TVX_ERR, "Unable to create TVXHBA_ConcreteJob");
    return nullptr;
  }
  fillJob(*job, testName, deleteOnCompletion, state, diagnosticID);
  TVXHBA_ConcreteJob* entry = insertDiagnostic(m_Agent.m_TVXHBA_ConcreteJob_map, std::move(job),
                                               TVX_CRIT, "", "Insert Failed: TVXHBA_ConcreteJob");
  if (entry) associateJob(m_Agent, entry, testName, element);
  return entry;
}

std::int32_t TVX_Diagnostics::DeleteConcreteJob(const TVXHBA_ConcreteJob* job) {
  TVX_LOG(TVX_DBG, "TVXHBA_DiagTestFunc::DeleteConcreteJob()");
  if (!job) {
    TVX_LOG(TVX_DBG, "Invalid Job ID");
    return DIAGNOSTICS_NO_JOB;
  }
  dropAssociation(m_Agent.m_TVXHBA_OwningJobElement_map, &TVXHBA_OwningJobElement::OwnedElement,
                  job);
  dropAssociation(m_Agent.m_TVXHBA_AffectedJobElement_map,
                  &TVXHBA_AffectedJobElement::AffectingElement, job);
  m_Agent.m_TVXHBA_ConcreteJob_map.delete_instance(job);
  return 0;
}

}  // namespace cimrt
