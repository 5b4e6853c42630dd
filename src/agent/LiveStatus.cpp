#include "agent/LiveStatus.h"

#include "agent/FCPortTables.h"
#include "agent/Live_Throttle.h"

namespace cimrt {

bool startDriverUpdate(Live_Throttle& throttle) {
  TVX_LOG(TVX_DBG, "Checking driver TimeOut...");
  if (!throttle.isDue()) {
    TVX_LOG(TVX_DBG, "PERF: Refresh Not yet required");
    return false;
  }
  TVX_LOG(TVX_DBG, "PERF: update driver map");
  throttle.start();
  return true;
}

// --- Counters ------------------------------------------------------------------------------------

namespace {

/// How one counter of the hardware becomes a property.
struct Counter_Rule {
  Property<std::uint64_t> TVXHBA_FCPortStatistics::*property;
  std::uint32_t identifier;
  std::uint64_t factor;  ///< what one unit of the counter stands for
  bool keepsLastGood;    ///< a counter that is not supplied leaves the property's last value
};

constexpr std::uint64_t BYTES_PER_WORD = 4;
using Stats = TVXHBA_FCPortStatistics;

constexpr Counter_Rule COUNTERS[] = {
    {&Stats::BytesTransmitted, RM_PS_TX_WORDS, BYTES_PER_WORD, false},
    {&Stats::BytesReceived, RM_PS_RX_WORDS, BYTES_PER_WORD, false},
    {&Stats::PacketsTransmitted, RM_PS_TX_FRAMES, 1, false},
    {&Stats::PacketsReceived, RM_PS_RX_FRAMES, 1, false},
    {&Stats::LIPCount, RM_PS_LIP_COUNT, 1, false},
    {&Stats::NOSCount, RM_PS_NOS_COUNT, 1, true},
    {&Stats::ErrorFrames, RM_PS_ERROR_FRAMES, 1, false},
    {&Stats::DumpedFrames, RM_PS_DUMPED_FRAMES, 1, true},
    {&Stats::LinkFailures, RM_PS_LINK_FAILURES, 1, false},
    {&Stats::LossOfSyncCounter, RM_PS_LOSS_OF_SYNC, 1, false},
    {&Stats::LossOfSignalCounter, RM_PS_LOSS_OF_SIGNAL, 1, false},
    {&Stats::PrimitiveSeqProtocolErrCount, RM_PS_PRIMITIVE_SEQ_ERRORS, 1, false},
    {&Stats::InvalidTransmissionWords, RM_PS_INVALID_TX_WORDS, 1, false},
    {&Stats::CRCErrors, RM_PS_CRC_ERRORS, 1, false},
    {&Stats::TxSequences, RM_PS_TX_SEQUENCES, 1, false},
    {&Stats::RxSequences, RM_PS_RX_SEQUENCES, 1, false},
    {&Stats::ExCountOrig, RM_PS_EXCHANGES_ORIGINATED, 1, false},
    {&Stats::ExCountResp, RM_PS_EXCHANGES_RESPONDED, 1, false},
    {&Stats::LinkTransitions, RM_PS_LINK_TRANSITIONS, 1, false},
    {&Stats::ActiveRPIs, RM_PS_ACTIVE_RPIS, 1, false},
    {&Stats::ActiveXRIs, RM_PS_ACTIVE_XRIS, 1, false},
    {&Stats::PrimitiveSeqTimesouts, RM_PS_PRIMITIVE_SEQ_TIMEOUTS, 1, false},
    {&Stats::ElasticBufOverruns, RM_PS_ELASTIC_OVERRUNS, 1, false},
    {&Stats::ArbitrationTimeouts, RM_PS_ARBITRATION_TIMEOUTS, 1, false},
};

void takeCounters(TVXHBA_FCPortStatistics& entry, const FCPortStatistics& counters) {
  for (const Counter_Rule& rule : COUNTERS) {
    Property<std::uint64_t>& property = entry.*rule.property;
    const std::uint64_t value = counters.counter(rule.identifier);
    if (!rule.keepsLastGood || value < FCPortStatistics::NOT_SUPPLIED)
      property.set(value * rule.factor);
    else
      property.set(std::uint64_t{property.value});  // 0 as long as there was no good value
  }
}

void updateStatistics(ProviderAgent& agent, Port& port) {
  TVXHBA_FCPortStatistics* entry = findContaining(
      agent.m_TVXHBA_FCPortStatistics_map, &TVXHBA_FCPortStatistics::InstanceID, port.m_Name);
  if (!entry) return;
  takeCounters(*entry, dynamic_cast<const FCPortStatistics&>(*port.refreshStatistics()));
  entry->StatisticTime.set(tvxNowDatetime());
  TVX_LOG(TVX_DBG, "PERF: GetFCPortStats: cleanExit");
}

}  // namespace

void GetFCPortStats(ProviderAgent& agent) {
  static Lasting<Live_Throttle> throttle(PORT_UPDATE_PERIOD);
  TVX_LOG(TVX_DBG, "PERF: GetFCPortStats: Entry");
  if (!throttle->isDue()) {
    TVX_LOG(TVX_DBG, "GetFCPortStats() :Refresh Not yet required");
    return;
  }
  TVX_LOG(TVX_DBG, "GetFCPortStats(): Update");
  throttle->start();
  forEachFCPort(agent, [&](Adapter&, Port& port) {
    updateStatistics(agent, port);
    return true;
  });
}

// --- Link status ---------------------------------------------------------------------------------

void setLinkState(TVXHBA_FCPort& port, const FCPortAttributes& from) {
  const Port_Status& status = portStatus(from.PortState);
  port.OperationalStatus.set({status.operationalStatus});
  port.StatusDescriptions.set({status.description});
  const Port_Type& type = portType(from.PortType);
  port.PortType.set(type.portType);
  port.OtherPortType.set(type.otherPortType);
  port.ElementName.set(from.PortSymbolicName.c_str());
  port.FabricName.set(from.FabricName.c_str());
  port.Speed.set(portSpeed(from.PortSpeed));
}

void UpdateFCPortStatus(ProviderAgent& agent) {
  static Lasting<Live_Throttle> throttle(PORT_UPDATE_PERIOD);
  TVX_LOG(TVX_DBG, "PERF: UpdateFCPortStatus: Entry");
  if (!startDriverUpdate(*throttle)) return;
  forEachFCPort(agent, [&](Adapter& adapter, Port& port) {
    TVXHBA_FCPort* entry =
        findContaining(agent.m_TVXHBA_FCPort_map, &TVXHBA_FCPort::DeviceID, port.m_Name);
    if (entry) setLinkState(*entry, FCPortAttributes(&adapter, port.m_Index));
    return true;
  });
}

}  // namespace cimrt
