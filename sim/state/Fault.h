// Faults: which calls they hit and what they do to them.
#pragma once

#include <cstddef>
#include <cstdint>
#include <limits>
#include <optional>
#include <set>
#include <string>
#include <string_view>
#include <vector>

#include "state/Wwn.h"

namespace tvx::sim {

/// What the faults that apply do to one call; the empty effect leaves the call as it is.
struct Fault_Effect {
  std::optional<std::int64_t> status;          ///< answered instead of doing the work
  std::uint32_t delay_ms = 0;                  ///< waited before anything else
  std::set<std::uint32_t> omitted;             ///< attribute numbers left out of the answer
  bool unterminated = false;                   ///< texts fill their fields without an end
  bool garbage = false;                        ///< the told room is filled with a byte pattern
  std::optional<std::size_t> truncated;        ///< only so many bytes are written
  std::optional<std::uint32_t> returned_size;  ///< size or count told instead of the true one
  std::vector<std::uint8_t> sense;             ///< SCSI sense data that goes with the status

  void merge(const Fault_Effect& other);
};

/// A call as the rules see it.
struct Call_Site {
  std::string_view name;        ///< entry point, as exported
  std::optional<Wwn> port{};    ///< local port that the call is about
  std::string adapter{};        ///< SNIA adapter name, empty when there is none
  std::optional<Wwn> target{};  ///< remote port
  std::optional<std::uint64_t> lun{};
  std::optional<std::uint32_t> page{};  ///< of an INQUIRY; standard_page without one
};

/// One fault of a scenario. The rule counts the calls that fit it, from 1, and acts on those from
/// `from` on, `count` of them.
struct Fault_Rule {
  std::vector<std::string> calls;  ///< names; a trailing "*" stands for any ending
  std::optional<Wwn> port;
  std::string adapter;
  std::optional<Wwn> target;
  std::optional<std::uint64_t> lun;
  std::optional<std::uint32_t> page;
  std::uint64_t from = 1;
  std::uint64_t count = std::numeric_limits<std::uint64_t>::max();
  Fault_Effect effect;
  std::uint64_t seen = 0;  ///< calls that fitted so far

  /// Whether the rule is about this call at all.
  bool fits(const Call_Site& call) const;
  /// Counts the call, which must fit, and tells whether the rule acts on it.
  bool count_call();
};

/// "LRM_X" and "RM_X" are one entry point under two names; this is the name without the "L".
std::string_view entry_point(std::string_view name);

/// Counts the call in every rule that fits and joins the effects of those that act.
Fault_Effect apply_rules(std::vector<Fault_Rule>& rules, const Call_Site& call);

}  // namespace tvx::sim
