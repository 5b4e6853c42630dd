#include "state/Json_Reader.h"

#include <cerrno>
#include <cstdlib>
#include <utility>

namespace tvx::sim {
namespace {

const nlohmann::json null_json;

std::string listed(const std::map<std::string, std::uint32_t>& names) {
  std::string text;
  for (const auto& entry : names) text += (text.empty() ? "\"" : ", \"") + entry.first + "\"";
  return text;
}

}  // namespace

std::optional<std::uint64_t> json_unsigned(const nlohmann::json& value) {
  if (value.is_number_unsigned()) return value.get<std::uint64_t>();
  if (!value.is_string()) return std::nullopt;
  const std::string text = value.get<std::string>();
  if (text.empty() || text[0] < '0' || text[0] > '9') return std::nullopt;
  char* end = nullptr;
  errno = 0;
  const std::uint64_t number = std::strtoull(text.c_str(), &end, 0);
  if (*end != '\0' || errno != 0) return std::nullopt;
  return number;
}

std::optional<std::vector<std::uint8_t>> parse_hex(const std::string& text) {
  std::string digits;
  for (const char c : text) {
    if (c == ' ' || c == ':') continue;
    if (!std::isxdigit(static_cast<unsigned char>(c))) return std::nullopt;
    digits += c;
  }
  if (digits.size() % 2 != 0) return std::nullopt;
  std::vector<std::uint8_t> bytes;
  for (std::size_t i = 0; i < digits.size(); i += 2) {
    bytes.push_back(
        static_cast<std::uint8_t>(std::strtoul(digits.substr(i, 2).c_str(), nullptr, 16)));
  }
  return bytes;
}

Json_Reader::Json_Reader(const nlohmann::json& object, std::string pointer)
    : m_pObject(&object), m_Pointer(std::move(pointer)) {
  if (!object.is_object()) throw Scenario_Error(m_Pointer, "must be an object");
}

bool Json_Reader::has(const std::string& key) const {
  m_Known.insert(key);
  return m_pObject->contains(key);
}

const nlohmann::json& Json_Reader::raw(const std::string& key) const {
  return has(key) ? m_pObject->at(key) : null_json;
}

void Json_Reader::fail(const std::string& key, const std::string& message) const {
  throw Scenario_Error(m_Pointer + "/" + key, message);
}

std::string Json_Reader::text(const std::string& key, const std::string& fallback) const {
  if (!has(key)) return fallback;
  if (!raw(key).is_string()) fail(key, "must be a text");
  return raw(key).get<std::string>();
}

bool Json_Reader::flag(const std::string& key, bool fallback) const {
  if (!has(key)) return fallback;
  if (!raw(key).is_boolean()) fail(key, "must be true or false");
  return raw(key).get<bool>();
}

double Json_Reader::real(const std::string& key, double fallback) const {
  if (!has(key)) return fallback;
  if (!raw(key).is_number()) fail(key, "must be a number");
  return raw(key).get<double>();
}

Wwn Json_Reader::wwn(const std::string& key, const Wwn& fallback) const {
  if (!has(key)) return fallback;
  const std::optional<Wwn> name = parse_wwn(text(key, {}));
  if (!name) fail(key, "must be a world wide name: 16 hexadecimal digits or eight pairs");
  return *name;
}

std::uint64_t Json_Reader::unsigned_value(const std::string& key, std::uint64_t limit) const {
  const std::optional<std::uint64_t> number = json_unsigned(raw(key));
  if (!number || *number > limit) {
    fail(key, "must be a number from 0 to " + std::to_string(limit));
  }
  return *number;
}

std::uint32_t Json_Reader::choice(const std::string& key, std::uint32_t fallback,
                                  const std::map<std::string, std::uint32_t>& names) const {
  if (!has(key)) return fallback;
  if (raw(key).is_string()) {
    const auto found = names.find(raw(key).get<std::string>());
    if (found != names.end()) return found->second;
  }
  const std::optional<std::uint64_t> number = json_unsigned(raw(key));
  if (!number || *number > std::numeric_limits<std::uint32_t>::max()) {
    fail(key, "must be a number or one of " + listed(names));
  }
  return static_cast<std::uint32_t>(*number);
}

std::vector<std::string> Json_Reader::texts(const std::string& key) const {
  const nlohmann::json& value = raw(key);
  if (value.is_null()) return {};
  if (value.is_string()) return {value.get<std::string>()};
  if (!value.is_array()) fail(key, "must be a text or an array of texts");
  std::vector<std::string> result;
  for (const nlohmann::json& element : value) {
    if (!element.is_string()) fail(key, "must hold texts only");
    result.push_back(element.get<std::string>());
  }
  return result;
}

std::vector<std::uint8_t> Json_Reader::bytes(const std::string& key) const {
  const std::optional<std::vector<std::uint8_t>> value = parse_hex(text(key, {}));
  if (!value) fail(key, "must be pairs of hexadecimal digits");
  return *value;
}

std::vector<Json_Reader> Json_Reader::objects(const std::string& key) const {
  const nlohmann::json& value = raw(key);
  if (value.is_null()) return {};
  if (!value.is_array()) fail(key, "must be an array of objects");
  std::vector<Json_Reader> result;
  for (std::size_t i = 0; i < value.size(); ++i) {
    result.emplace_back(value[i], m_Pointer + "/" + key + "/" + std::to_string(i));
  }
  return result;
}

std::optional<Json_Reader> Json_Reader::object(const std::string& key) const {
  if (raw(key).is_null()) return std::nullopt;
  return Json_Reader(raw(key), m_Pointer + "/" + key);
}

void Json_Reader::finish() const {
  for (const auto& member : m_pObject->items()) {
    if (member.key() != "comment" && member.key() != "$schema" && !m_Known.contains(member.key())) {
      fail(member.key(), "is not a name that is known here");
    }
  }
}

}  // namespace tvx::sim
