// The `luns` and `tree` commands: logical units the way a person looks at them.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "Broker.h"
#include "cli/Ports.h"

namespace tvx::host {

/// One logical unit seen through one port.
struct LunRow {
  std::string port;       ///< WWPN in pairs
  std::string target;     ///< the same
  std::string targetId;   ///< FC address, "0x010100"
  std::string lun;        ///< its number, or its 16 digits where they are of no known form
  std::string className;  ///< of the device; empty if the unit has none
  std::string type;
  std::string vendor;
  std::string model;
  std::string revision;
  std::string serial;
  std::optional<std::uint64_t> capacity;  ///< bytes; nothing where the unit tells none
  std::string osDevice;
  bool answers = false;  ///< the unit answered an inquiry
};

/// Makes the rows out of TVXHBA_SCSIProtocolEndpoint instances and the instances of all classes of
/// devices, which find each other by port, target and LUN. In the order of the endpoints.
std::vector<LunRow> lunRows(const std::vector<Instance>& endpoints,
                            const std::vector<Instance>& devices);

/// Words of a SCSI peripheral device type: "disk", "tape"; "type 0x1F" for one without.
std::string deviceTypeWords(std::uint64_t type);

/// Bytes in the unit that leaves at most four digits: "100 GiB", "1.5 TiB", "512 B".
std::string capacityWords(std::uint64_t bytes);

std::string lunTable(const std::vector<LunRow>& rows);

/// A card with what lies below it; the last one of a host may stand for ports without a card.
struct CardNode {
  std::string model;
  std::string serial;
  std::vector<PortRow> ports;
};

/// Cards in their order with their ports.
std::vector<CardNode> cardNodes(const std::vector<Instance>& ports,
                                const std::vector<Instance>& cards);

/// '+' in order, '!' in trouble, '?' unknown.
char portMark(const PortRow& port);
/// '!' with a port in trouble, '+' with only ports in order, else '?'.
char cardMark(const CardNode& card);
/// '+' if one of its units answers, else '!'.
char targetMark(const std::vector<LunRow>& units);

/// Units of one remote port behind one port.
struct TargetNode {
  std::string wwpn;
  std::string fcId;
  std::vector<LunRow> units;
};

/// What lies behind a port, in the order of the rows.
std::vector<TargetNode> targetNodes(const PortRow& port, const std::vector<LunRow>& rows);

/// The host as an indented tree with a mark on each line.
std::string treeText(const std::string& host, const std::vector<CardNode>& cards,
                     const std::vector<LunRow>& rows);

}  // namespace tvx::host
