#include <cctype>

#include "state/Scenario_Parts.h"

namespace tvx::sim {
namespace {

// Attribute numbers by the names of any family, or as numbers.
std::set<std::uint32_t> read_omitted(const Json_Reader& fault) {
  std::set<std::uint32_t> numbers;
  for (const std::string& name : fault.texts("omit_attributes")) {
    std::optional<std::uint32_t> number = attribute_number(card_attribute_rows(), name);
    if (!number) number = attribute_number(port_attribute_rows(), name);
    if (!number) number = attribute_number(statistic_rows(), name);
    if (!number) number = attribute_number(lun_attribute_rows(), name);
    if (!number) fault.fail("omit_attributes", "does not know the attribute \"" + name + "\"");
    numbers.insert(*number);
  }
  return numbers;
}

void read_effect(const Json_Reader& fault, Fault_Effect& effect) {
  const nlohmann::json& status = fault.raw("status");
  if (!status.is_null()) {
    if (!status.is_number_integer()) fault.fail("status", "must be a whole number");
    effect.status = status.get<std::int64_t>();
  }
  effect.delay_ms = fault.number<std::uint32_t>("delay_ms", 0);
  effect.omitted = read_omitted(fault);
  effect.unterminated = fault.flag("unterminated_texts", false);
  effect.garbage = fault.flag("garbage", false);
  effect.sense = fault.bytes("sense");
  if (fault.has("write_only")) effect.truncated = fault.number<std::uint32_t>("write_only", 0);
  if (fault.has("returned_size")) {
    effect.returned_size = fault.number<std::uint32_t>("returned_size", 0);
  }
}

// "nth": 3 is the third call alone, "first": 2 the first two, "from": 3 the third and all after it.
void read_occasion(const Json_Reader& fault, Fault_Rule& rule) {
  const int given = int{fault.has("nth")} + int{fault.has("first")} + int{fault.has("from")};
  if (given > 1) fault.fail("nth", "excludes \"first\" and \"from\"");
  rule.from = fault.number<std::uint64_t>("nth", fault.number<std::uint64_t>("from", 1));
  if (rule.from == 0) fault.fail("nth", "counts from 1");
  if (fault.has("nth")) rule.count = 1;
  rule.count = fault.number<std::uint64_t>("first", rule.count);
  rule.count = fault.number<std::uint64_t>("count", rule.count);
}

}  // namespace

Fault_Rule read_fault(const Json_Reader& fault) {
  Fault_Rule rule;
  rule.calls = fault.texts("call");
  if (rule.calls.empty()) fault.fail("call", "must name at least one entry point");
  if (fault.has("port")) rule.port = fault.wwn("port", {});
  if (fault.has("target")) rule.target = fault.wwn("target", {});
  if (fault.has("lun")) rule.lun = fault.number<std::uint64_t>("lun", 0);
  if (fault.has("page")) rule.page = fault.choice("page", 0, {{"standard", standard_page}});
  rule.adapter = fault.text("adapter", {});
  read_occasion(fault, rule);
  read_effect(fault, rule.effect);
  fault.finish();
  return rule;
}

}  // namespace tvx::sim
