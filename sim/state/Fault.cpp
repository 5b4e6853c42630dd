#include "state/Fault.h"

#include <algorithm>

namespace tvx::sim {
namespace {

bool name_fits(const std::string& pattern, std::string_view name) {
  std::string_view wanted = entry_point(pattern);
  if (!wanted.empty() && wanted.back() == '*') {
    wanted.remove_suffix(1);
    return name.starts_with(wanted) || entry_point(name).starts_with(wanted);
  }
  return entry_point(name) == wanted;
}

// A rule that names something fits only calls that are about that very thing.
template <class T>
bool wanted_fits(const std::optional<T>& wanted, const std::optional<T>& given) {
  return !wanted || (given && *given == *wanted);
}

}  // namespace

std::string_view entry_point(std::string_view name) {
  if (name.starts_with("LRM_")) name.remove_prefix(1);
  return name;
}

void Fault_Effect::merge(const Fault_Effect& other) {
  if (!status) status = other.status;
  delay_ms += other.delay_ms;
  omitted.insert(other.omitted.begin(), other.omitted.end());
  unterminated = unterminated || other.unterminated;
  garbage = garbage || other.garbage;
  if (!truncated) truncated = other.truncated;
  if (!returned_size) returned_size = other.returned_size;
  if (sense.empty()) sense = other.sense;
}

bool Fault_Rule::fits(const Call_Site& call) const {
  const bool named = std::any_of(calls.begin(), calls.end(), [&call](const std::string& pattern) {
    return name_fits(pattern, call.name);
  });
  return named && wanted_fits(port, call.port) && wanted_fits(target, call.target) &&
         wanted_fits(lun, call.lun) && wanted_fits(page, call.page) &&
         (adapter.empty() || adapter == call.adapter);
}

bool Fault_Rule::count_call() {
  ++seen;
  return seen >= from && seen - from < count;
}

Fault_Effect apply_rules(std::vector<Fault_Rule>& rules, const Call_Site& call) {
  Fault_Effect effect;
  for (Fault_Rule& rule : rules) {
    if (rule.fits(call) && rule.count_call()) effect.merge(rule.effect);
  }
  return effect;
}

}  // namespace tvx::sim
