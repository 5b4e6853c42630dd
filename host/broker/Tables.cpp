#include "broker/Tables.h"

#include <cstring>

#include "broker/Core.h"

namespace tvx::host {
namespace {

constexpr int version100 = 100;
constexpr int versionZero = 0;

/// Slots that a server of version 0 leaves null.
void dropThreadControl(CMPIBrokerExtFT& table) {
  table.joinThread = nullptr;
  table.exitThread = nullptr;
  table.cancelThread = nullptr;
  table.threadSleep = nullptr;
  table.signalCondition = nullptr;
}

}  // namespace

template <class T>
T* Tables::copy(const T& full, std::size_t size) {
  m_Blocks.push_back(std::make_unique<std::byte[]>(size));
  std::memcpy(m_Blocks.back().get(), &full, size);
  return reinterpret_cast<T*>(m_Blocks.back().get());
}

template <class T>
const T* Tables::objectTable(const T& full, std::size_t size) {
  T* table = copy(full, size);
  table->ftVersion = m_TableVersion;
  return table;
}

void Tables::makeObjectTables(bool first) {
  instance = objectTable(instanceTable, first ? offsetof(CMPIInstanceFT, setPropertyWithOrigin)
                                              : sizeof(CMPIInstanceFT));
  objectPath = objectTable(objectPathTable,
                           first ? offsetof(CMPIObjectPathFT, toString) : sizeof(CMPIObjectPathFT));
  result =
      objectTable(resultTable, first ? offsetof(CMPIResultFT, returnError) : sizeof(CMPIResultFT));
  string = objectTable(stringTable, offsetof(CMPIStringFT, newCharsCP));
  args = objectTable(argsTable, sizeof(CMPIArgsFT));
  array = objectTable(arrayTable, sizeof(CMPIArrayFT));
  dateTime = objectTable(dateTimeTable, sizeof(CMPIDateTimeFT));
  enumeration = objectTable(enumerationTable, sizeof(CMPIEnumerationFT));
  context = objectTable(contextTable, sizeof(CMPIContextFT));
  selectExp = objectTable(selectExpTable, sizeof(CMPISelectExpFT));
}

void Tables::makeBroker(Core& core, int version) {
  const bool first = version == version100;
  auto* upCalls = copy(upCallTable, offsetof(CMPIBrokerFT, enumerateInstancesFiltered));
  upCalls->brokerVersion = version;
  auto* threads = copy(threadTable, offsetof(CMPIBrokerExtFT, destroyMutex2));
  threads->ftVersion = m_TableVersion;
  if (version == versionZero) {
    dropThreadControl(*threads);
  }
  CMPIBroker full{};
  full.hdl = &core;
  full.bft = upCalls;
  full.eft = objectTable(encapsulationTable, first ? offsetof(CMPIBrokerEncFT, newCMPIError)
                                                   : offsetof(CMPIBrokerEncFT, newPropertyList));
  full.xft = threads;
  if (!first && version != versionZero) {
    full.mft = objectTable(memoryTable, offsetof(CMPIBrokerMemFT, freeChars));
  }
  m_Broker = copy(full, first ? offsetof(CMPIBroker, mft) : sizeof(CMPIBroker));
}

Tables::Tables(Core& core, int version) : m_TableVersion(version == versionZero ? 1 : version) {
  makeObjectTables(version == version100);
  makeBroker(core, version);
}

}  // namespace tvx::host
