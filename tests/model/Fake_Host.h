// A host with adapters, made of plain values, below the loader.
#pragma once

#include <algorithm>
#include <cstdint>
#include <cstring>
#include <functional>
#include <map>
#include <string>
#include <vector>

#include "access/TVX_Runtime_Loader.h"
#include "support/Fake_Libraries.h"

namespace tvx::test {

inline HBA_WWN wwnOf(std::uint8_t first, std::uint8_t last) {
  return {{first, 0, 0, 0, 0, 0, 0, last}};
}

template <class T>
std::string rawBytes(T value) {
  return {reinterpret_cast<const char*>(&value), sizeof value};
}

/// Attribute values by key.
using Attributes = std::map<std::uint32_t, std::string>;

struct Fake_Port {
  HBA_PORTATTRIBUTES snia{};
  Attributes attributes;
  Attributes statistics;
  std::vector<HBA_STATUS> statuses;  // of the calls to come; then 0
  RM_STATUS attributesStatus = 0;
  RM_STATUS statisticsStatus = 0;
};

struct Fake_Adapter {
  std::string name;
  HBA_ADAPTERATTRIBUTES snia{};
  Attributes attributes;
  std::vector<Fake_Port> ports;
  std::vector<HBA_STATUS> statuses;  // of the attribute calls to come; then 0
  HBA_STATUS nameStatus = 0;
  bool opens = true;
  RM_STATUS attributesStatus = 0;
  RM_STATUS driverTypeStatus = 0;
  std::uint32_t driverType = 0;
};

/// Answers the discovery's calls out of `adapters`. Handles are the adapter's index plus 1.
class Fake_Host {
 public:
  Fake_Host() {
    provideSnia();
    provideManagement();
    libraries.load();
  }

  /// An adapter with this many ports; WWPNs are 10:..:<10 * index + port>.
  Fake_Adapter& add(const std::string& name, std::uint32_t ports) {
    const auto index = static_cast<std::uint8_t>(adapters.size());
    Fake_Adapter& adapter = adapters.emplace_back();
    adapter.name = name;
    adapter.snia.NodeWWN = wwnOf(0x20, index);
    adapter.snia.NumberOfPorts = ports;
    for (std::uint8_t port = 0; port < ports; ++port) {
      Fake_Port& fake = adapter.ports.emplace_back();
      fake.snia.PortWWN = wwnOf(0x10, static_cast<std::uint8_t>(10 * index + port));
      fake.snia.NodeWWN = wwnOf(0x20, static_cast<std::uint8_t>(10 * index + port));
    }
    return adapter;
  }

  std::vector<Fake_Adapter> adapters;
  std::uint32_t count = 0;  ///< reported if not 0, instead of the number of adapters
  int open = 0;             ///< handles open now
  int refreshed = 0;        ///< calls of HBA_RefreshInformation
  int loaded = 0;           ///< calls of HBA_LoadLibrary
  Fake_Libraries libraries;

 private:
  static HBA_STATUS take(std::vector<HBA_STATUS>& statuses) {
    if (statuses.empty()) return 0;
    const HBA_STATUS status = statuses.front();
    statuses.erase(statuses.begin());
    return status;
  }

  void provideSnia() {
    libraries.provide(cimrt::HBA_LoadLibrary, [this] { return ++loaded > 0 ? 0U : 1U; });
    libraries.provide(cimrt::HBA_GetNumberOfAdapters, [this] {
      return count != 0 ? count : static_cast<HBA_UINT32>(adapters.size());
    });
    libraries.provide(cimrt::HBA_GetAdapterName, [this](HBA_UINT32 index, char* name) {
      if (index >= adapters.size()) return HBA_STATUS{6};
      std::strcpy(name, adapters[index].name.c_str());
      return adapters[index].nameStatus;
    });
    libraries.provide(cimrt::HBA_OpenAdapter, [this](char* name) {
      for (std::size_t i = 0; i < adapters.size(); ++i) {
        if (adapters[i].name != name || !adapters[i].opens) continue;
        ++open;
        return static_cast<HBA_HANDLE>(i + 1);
      }
      return HBA_HANDLE{0};
    });
    libraries.provide(cimrt::HBA_CloseAdapter, [this](HBA_HANDLE) { --open; });
    libraries.provide(cimrt::HBA_RefreshInformation, [this](HBA_HANDLE) { ++refreshed; });
    libraries.provide(cimrt::HBA_GetAdapterAttributes,
                      [this](HBA_HANDLE handle, HBA_ADAPTERATTRIBUTES* out) {
                        Fake_Adapter& adapter = adapters.at(handle - 1);
                        *out = adapter.snia;
                        return take(adapter.statuses);
                      });
    libraries.provide(cimrt::HBA_GetAdapterPortAttributes,
                      [this](HBA_HANDLE handle, HBA_UINT32 index, HBA_PORTATTRIBUTES* out) {
                        Fake_Adapter& adapter = adapters.at(handle - 1);
                        if (index >= adapter.ports.size()) return HBA_STATUS{6};
                        *out = adapter.ports[index].snia;
                        return take(adapter.ports[index].statuses);
                      });
  }

  /// The port with that name, and its adapter.
  std::pair<Fake_Adapter*, Fake_Port*> find(const HBA_WWN& wwpn) {
    for (Fake_Adapter& adapter : adapters) {
      for (Fake_Port& port : adapter.ports) {
        if (std::memcmp(&port.snia.PortWWN, &wwpn, sizeof wwpn) == 0) return {&adapter, &port};
      }
    }
    return {nullptr, nullptr};
  }

  // A block holds the address of its attributes.
  template <class Stub, class Pick>
  void provideBlock(const Stub& stub, std::uint32_t size, Pick pick) {
    libraries.provide(stub, [this, size, pick](HBA_WWN wwpn, void* block, std::uint32_t* length) {
      if (*length != size) return 99;
      const auto [adapter, port] = find(wwpn);
      if (port == nullptr) return 5;
      const auto [status, attributes] = pick(*adapter, *port);
      std::memcpy(block, &attributes, sizeof attributes);
      return status;
    });
  }

  void provideManagement() {
    using Picked = std::pair<RM_STATUS, Attributes*>;
    provideBlock(cimrt::LRM_GetHBAAttributes, 2864, [](Fake_Adapter& adapter, Fake_Port&) {
      return Picked{adapter.attributesStatus, &adapter.attributes};
    });
    provideBlock(cimrt::LRM_GetPortAttributes, 2048, [](Fake_Adapter&, Fake_Port& port) {
      return Picked{port.attributesStatus, &port.attributes};
    });
    provideBlock(cimrt::LRM_GetPortStatistics, 512, [](Fake_Adapter&, Fake_Port& port) {
      return Picked{port.statisticsStatus, &port.statistics};
    });
    libraries.provide(cimrt::LRM_GetDriverType, [this](HBA_WWN wwpn, std::uint32_t* type) {
      const Fake_Adapter& adapter = *find(wwpn).first;
      *type = adapter.driverType;
      return adapter.driverTypeStatus;
    });
    libraries.provide(cimrt::RM_GetAttributeValue,
                      [](const void* block, std::uint32_t key, std::uint32_t* length,
                         RM_STATUS* status) -> void* {
                        Attributes* attributes = nullptr;
                        std::memcpy(&attributes, block, sizeof attributes);
                        const auto found = attributes->find(key);
                        *status = found != attributes->end() ? 0 : 44;
                        if (found == attributes->end()) return nullptr;
                        *length = static_cast<std::uint32_t>(found->second.size());
                        return found->second.data();
                      });
  }
};

}  // namespace tvx::test
