// The device tree: what the host's adapters, their ports and the targets behind them report.
//
// Nothing here is a CIM object. The tree has no lock of its own: everything is read and written
// under the agent's data lock, and nothing may keep a pointer into it across a refresh.
#pragma once

#include <atomic>
#include <cstdint>
#include <string>
#include <vector>

#include "common/TVX_Memory.h"
#include "model/TVX_Attributes.h"
#include "model/TVX_Target.h"

namespace cimrt {

class Adapter;
class Port;

/// `Adapter::m_Type` of an FC adapter.
inline constexpr std::int32_t TVX_ADAPTER_TYPE_FC = 1;

/// Root of the tree.
class Data {
 public:
  Data();   ///< asks the SNIA library to load its vendor libraries
  ~Data();  ///< frees the tree
  Data(const Data&) = delete;
  Data& operator=(const Data&) = delete;

  /// Throws the tree away and builds it anew from the hardware. Failures skip adapters or ports.
  void buildAdapterData();
  /// Rebuilds the targets of every port. A failing adapter is passed over.
  void buildSANData();
  /// Makes a scan that is under way end before the next logical unit, with the targets found so
  /// far, and every later one at once: many units take minutes, and an unload does not wait for
  /// them. Any thread, with no lock held.
  void stopScan() { m_bScanStopped = true; }
  /// Frees the adapters and goes back to the empty state.
  void freeAllData();

  std::vector<Adapter*> m_Adapters;  ///< owned, in the order of the adapter index
  std::vector<Port*> m_Ports;        ///< not owned: every port of every adapter
  bool m_bFCCardFound = false;       ///< at least one adapter was kept
  std::uint32_t m_AdapterCount = 0;  ///< adapters reported, less the skipped ones

 private:
  void buildAdapter(std::uint32_t index);
  void keepAdapter(Adapter* adapter);

  std::atomic<bool> m_bScanStopped{false};
};

/// One adapter. Owns its attributes, statistics and ports.
class Adapter {
 public:
  Adapter();
  Adapter(const std::string& name, std::int32_t number, std::int32_t type);
  /// Shares attributes and ports with `other` without owning them: a copy must not be destroyed as
  /// an owner.
  Adapter(const Adapter& other);
  Adapter& operator=(const Adapter&) = delete;
  virtual ~Adapter() noexcept(false);

  virtual const std::string& getName() const = 0;
  virtual const std::int32_t& getNumber() const = 0;
  virtual const std::uint32_t& getFunctionType() const = 0;
  virtual AdapterAttributes* getAttributes() = 0;
  virtual AdapterStatistics* getStatistics() = 0;
  virtual std::size_t getNumberOfPorts() = 0;
  virtual std::vector<Port*>& getPorts() = 0;
  /// The port at a position of the list, which need not be its index on the adapter. Throws
  /// `std::out_of_range`.
  virtual Port* getPort(int index) = 0;
  /// Rebuilds the targets of every port. A failing port is passed over.
  virtual void rescanTargets() = 0;
  /// True once the tree's scans are to end. Any thread.
  bool isScanStopped() const { return m_pScanStopped != nullptr && *m_pScanStopped; }

  AdapterAttributes* m_pAttributes = nullptr;
  AdapterStatistics* m_pStatistics = nullptr;
  std::vector<Port*> m_Ports;
  std::string m_Name;
  std::int32_t m_Number = -1;
  std::uint32_t m_FunctionType = 0;
  std::int32_t m_Type = 0;
  const std::atomic<bool>* m_pScanStopped = nullptr;  ///< of the tree, not owned; null: no tree
};

/// An FC adapter. The constructor reads the hardware and throws `std::exception` if the adapter
/// can't be read; a port that can't be read is left out.
class FCAdapter : public Adapter {
 public:
  FCAdapter(const std::string& name, std::int32_t number);
  ~FCAdapter() noexcept(false) override;

  const std::string& getName() const override { return m_Name; }
  const std::int32_t& getNumber() const override { return m_Number; }
  const std::uint32_t& getFunctionType() const override { return m_FunctionType; }
  AdapterAttributes* getAttributes() override { return m_pAttributes; }
  AdapterStatistics* getStatistics() override { return m_pStatistics; }
  std::size_t getNumberOfPorts() override { return m_Ports.size(); }
  std::vector<Port*>& getPorts() override { return m_Ports; }
  Port* getPort(int index) override;
  void rescanTargets() override;

 private:
  void buildPorts(std::uint32_t count);
};

/// One port. Owns its attributes, statistics and targets.
class Port {
 public:
  explicit Port(Adapter* adapter);
  Port(const Port&) = delete;
  Port& operator=(const Port&) = delete;
  virtual ~Port() noexcept(false);  ///< frees the targets

  virtual PortAttributes* getAttributes() = 0;
  /// Reads the statistics afresh. The old ones stay if that throws.
  virtual PortStatistics* refreshStatistics() = 0;
  virtual Adapter* getAdapter() = 0;
  /// Rebuilds the targets; throws `std::exception` if the adapter can't be opened, with no target
  /// left.
  virtual void rescanTargets(Adapter* adapter) = 0;
  virtual std::vector<Target*>& getTargets() = 0;
  /// Throws `std::exception` when out of range.
  virtual Target* getTarget(int index) = 0;
  virtual std::size_t getNumberOfTargets() = 0;

  std::string m_Name;         ///< the WWPN, 16 upper-case digits
  std::uint32_t m_Index = 0;  ///< index on the adapter
  PortAttributes* m_pAttributes = nullptr;
  PortStatistics* m_pStatistics = nullptr;  ///< null until first read
  std::vector<Target*> m_Targets;
  Adapter* m_pAdapter;  ///< not owned

 protected:
  void freeTargets();
};

/// An FC port. The constructor reads the hardware and throws `std::exception` if it can't.
class FCPort : public Port {
 public:
  FCPort(Adapter* adapter, std::uint32_t index);
  ~FCPort() noexcept(false) override;

  PortAttributes* getAttributes() override { return m_pAttributes; }
  PortStatistics* refreshStatistics() override;
  Adapter* getAdapter() override { return m_pAdapter; }
  void rescanTargets(Adapter* adapter) override;
  std::vector<Target*>& getTargets() override { return m_Targets; }
  Target* getTarget(int index) override;
  std::size_t getNumberOfTargets() override { return m_Targets.size(); }

  std::string m_NodeName;  ///< the WWNN, 16 upper-case digits

 private:
  HBA_STATUS getFcpTargetMapping(HBA_HANDLE handle, TVX_Block& mapping, std::uint32_t& rows);
  void buildTargets(Adapter* adapter, const TVX_Block& mapping, std::uint32_t rows);
};

}  // namespace cimrt
