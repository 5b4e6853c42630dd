#include <algorithm>
#include <cstring>
#include <exception>

#include "access/TVX_AttributeReader.h"
#include "access/TVX_Runtime_Loader.h"
#include "common/CLogger.h"
#include "common/TVX_Memory.h"
#include "model/TVX_Attributes.h"
#include "model/TVX_Data.h"
#include "model/TVX_Snia.h"

namespace cimrt {

FCAdapterStatistics::FCAdapterStatistics(const Adapter* adapter) {
  static_cast<void>(adapter->getNumber());
}

const std::array<std::uint32_t, FCPortStatistics::COUNT + 1> FCPortStatistics::IDENTIFIERS = {
    RM_PS_FIRST,
    RM_PS_EXCHANGES_ORIGINATED,
    RM_PS_EXCHANGES_RESPONDED,
    RM_PS_TX_SEQUENCES,
    RM_PS_RX_SEQUENCES,
    RM_PS_TX_FRAMES,
    RM_PS_RX_FRAMES,
    RM_PS_TX_WORDS,
    RM_PS_RX_WORDS,
    RM_PS_LIP_COUNT,
    RM_PS_NOS_COUNT,
    RM_PS_ERROR_FRAMES,
    RM_PS_DUMPED_FRAMES,
    RM_PS_LINK_FAILURES,
    RM_PS_LOSS_OF_SYNC,
    RM_PS_LOSS_OF_SIGNAL,
    RM_PS_PRIMITIVE_SEQ_ERRORS,
    RM_PS_INVALID_TX_WORDS,
    RM_PS_CRC_ERRORS,
    RM_PS_LINK_TRANSITIONS,
    RM_PS_ACTIVE_RPIS,
    RM_PS_ACTIVE_XRIS,
    RM_PS_PRIMITIVE_SEQ_TIMEOUTS,
    RM_PS_ELASTIC_OVERRUNS,
    RM_PS_ARBITRATION_TIMEOUTS,
    0};

namespace {

constexpr std::uint64_t NO_COUNTER = ~std::uint64_t{0};  // how the hardware says that it has none

void readCounter(const void* block, std::uint32_t identifier, std::uint64_t& counter) {
  const TVX_Attribute attribute = findAttribute(block, identifier);
  if (attribute.value == nullptr || attribute.length == 0) return;
  std::uint64_t value = 0;
  std::memcpy(&value, attribute.value, std::min<std::size_t>(attribute.length, sizeof value));
  if (value != NO_COUNTER) counter = value;
}

}  // namespace

FCPortStatistics::FCPortStatistics(const std::string& portName) {
  m_Counters.fill(NOT_SUPPLIED);
  const TVX_Block block = allocateAttributeBlock(RM_PORT_STATISTICS_SIZE);
  if (block == nullptr) throw std::exception();
  std::uint32_t length = RM_PORT_STATISTICS_SIZE;
  const RM_STATUS status = LRM_GetPortStatistics(portNameToWWN(portName), block.get(), &length);
  if (status != RM_OK) {
    TVX_LOG(TVX_ERR, "ERROR: RM_GetPortStatistics call failed (%d)", status);
    throw std::exception();
  }
  for (std::size_t i = 0; IDENTIFIERS[i] != 0; ++i) {
    readCounter(block.get(), IDENTIFIERS[i], m_Counters[i]);
  }
}

std::uint64_t FCPortStatistics::counter(std::uint32_t identifier) const {
  const auto last = IDENTIFIERS.end() - 1;
  const auto found = std::find(IDENTIFIERS.begin(), last, identifier);
  if (found == last) return NOT_SUPPLIED;
  return m_Counters[static_cast<std::size_t>(found - IDENTIFIERS.begin())];
}

}  // namespace cimrt
