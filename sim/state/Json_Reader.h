// Reading scenario objects with messages that say where the mistake is.
#pragma once

#include <cstdint>
#include <limits>
#include <map>
#include <nlohmann/json.hpp>
#include <optional>
#include <set>
#include <stdexcept>
#include <string>
#include <vector>

#include "state/Wwn.h"

namespace tvx::sim {

/// A scenario that cannot be used. The text starts with the JSON pointer of the offending value.
class Scenario_Error : public std::runtime_error {
 public:
  Scenario_Error(const std::string& pointer, const std::string& message)
      : std::runtime_error((pointer.empty() ? std::string("/") : pointer) + ": " + message) {}
};

/// One JSON object being read. Each getter takes the name of a member and what to answer when the
/// member is absent, and throws Scenario_Error on a value of the wrong kind. `finish` then refuses
/// members that nothing asked for, so that a misspelt name never passes unnoticed.
class Json_Reader {
 public:
  Json_Reader(const nlohmann::json& object, std::string pointer);

  bool has(const std::string& key) const;
  std::string text(const std::string& key, const std::string& fallback) const;
  bool flag(const std::string& key, bool fallback) const;
  double real(const std::string& key, double fallback) const;
  Wwn wwn(const std::string& key, const Wwn& fallback) const;
  /// A number, or a text such as "0xE200".
  template <class T>
  T number(const std::string& key, T fallback) const {
    return has(key) ? static_cast<T>(unsigned_value(key, std::numeric_limits<T>::max())) : fallback;
  }
  /// A number, or one of the texts of `names`.
  std::uint32_t choice(const std::string& key, std::uint32_t fallback,
                       const std::map<std::string, std::uint32_t>& names) const;
  /// The texts of an array; a single text counts as an array of one.
  std::vector<std::string> texts(const std::string& key) const;
  /// The bytes of a text of hexadecimal digits; blanks and colons between them are allowed.
  std::vector<std::uint8_t> bytes(const std::string& key) const;
  /// The objects of an array; none when the member is absent.
  std::vector<Json_Reader> objects(const std::string& key) const;
  std::optional<Json_Reader> object(const std::string& key) const;
  /// The member as it stands; null when absent.
  const nlohmann::json& raw(const std::string& key) const;

  /// Refuses members that no getter asked for.
  void finish() const;
  [[noreturn]] void fail(const std::string& key, const std::string& message) const;
  const std::string& pointer() const { return m_Pointer; }

 private:
  std::uint64_t unsigned_value(const std::string& key, std::uint64_t limit) const;

  const nlohmann::json* m_pObject;
  std::string m_Pointer;
  mutable std::set<std::string> m_Known;
};

/// A number given as such or as a text such as "0xE200"; nothing for anything else.
std::optional<std::uint64_t> json_unsigned(const nlohmann::json& value);

/// The bytes of a text of hexadecimal digits, blanks and colons ignored; nothing if malformed.
std::optional<std::vector<std::uint8_t>> parse_hex(const std::string& text);

}  // namespace tvx::sim
