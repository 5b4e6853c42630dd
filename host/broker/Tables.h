// The function tables of one broker, in the sizes that its version has.
#pragma once

#include <cstddef>
#include <memory>
#include <vector>

#include "cmpi/cmpift.h"

namespace tvx::host {

class Core;

/// Heap copies of the full tables, each exactly as long as the version makes it, so that a memory
/// checker catches a provider that reads a slot which the version does not have.
class Tables {
 public:
  /// `version` is 100, 200, or 0 for a server that calls itself 0 with tables of version 1.
  Tables(Core& core, int version);

  const CMPIBroker* broker() const { return m_Broker; }
  /// Value of `ftVersion` in every table.
  CMPIVersion tableVersion() const { return m_TableVersion; }

  const CMPIInstanceFT* instance = nullptr;
  const CMPIObjectPathFT* objectPath = nullptr;
  const CMPIArgsFT* args = nullptr;
  const CMPIStringFT* string = nullptr;
  const CMPIArrayFT* array = nullptr;
  const CMPIDateTimeFT* dateTime = nullptr;
  const CMPIEnumerationFT* enumeration = nullptr;
  const CMPIContextFT* context = nullptr;
  const CMPIResultFT* result = nullptr;
  const CMPISelectExpFT* selectExp = nullptr;

 private:
  template <class T>
  T* copy(const T& full, std::size_t size);
  template <class T>
  const T* objectTable(const T& full, std::size_t size);
  void makeObjectTables(bool first);
  void makeBroker(Core& core, int version);

  CMPIVersion m_TableVersion;
  std::vector<std::unique_ptr<std::byte[]>> m_Blocks;
  const CMPIBroker* m_Broker = nullptr;
};

// The full tables, each next to the functions that it holds.
extern const CMPIInstanceFT instanceTable;
extern const CMPIObjectPathFT objectPathTable;
extern const CMPIArgsFT argsTable;
extern const CMPIStringFT stringTable;
extern const CMPIArrayFT arrayTable;
extern const CMPIDateTimeFT dateTimeTable;
extern const CMPIEnumerationFT enumerationTable;
extern const CMPIContextFT contextTable;
extern const CMPIResultFT resultTable;
extern const CMPISelectExpFT selectExpTable;
extern const CMPIBrokerFT upCallTable;
extern const CMPIBrokerEncFT encapsulationTable;
extern const CMPIBrokerExtFT threadTable;
extern const CMPIBrokerMemFT memoryTable;

}  // namespace tvx::host
