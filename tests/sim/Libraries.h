// The simulated libraries as a test sees them: opened by path, entry points found by name.
#pragma once

#include <dlfcn.h>
#include <gtest/gtest.h>

#include <cstdint>
#include <cstring>
#include <string>
#include <vector>

#include "rmapi/rmapi.h"
#include "tvxsim/tvxsim.h"

namespace tvx::sim_test {

/// An opened library; closed with the object.
class Library {
 public:
  explicit Library(const char* path) : m_pHandle(dlopen(path, RTLD_NOW)) {
    EXPECT_NE(m_pHandle, nullptr) << dlerror();
  }
  ~Library() {
    if (m_pHandle != nullptr) dlclose(m_pHandle);
  }
  Library(const Library&) = delete;
  Library& operator=(const Library&) = delete;

  bool has(const char* name) const { return dlsym(m_pHandle, name) != nullptr; }

  /// The entry point with this name, of the type given.
  template <class Function>
  Function* entry(const char* name) const {
    auto* function = reinterpret_cast<Function*>(dlsym(m_pHandle, name));
    if (function == nullptr) {
      ADD_FAILURE() << name << " is missing";
      std::abort();
    }
    return function;
  }

 private:
  void* m_pHandle;
};

// Calls an entry point that is declared in the interface headers by its own name and type.
#define SIM_CALL(library, name, ...) (library).entry<decltype(::name)>(#name)(__VA_ARGS__)

/// Both libraries over a scenario of the test's own, with the built-in one to begin with.
class Simulated_Host : public ::testing::Test {
 protected:
  Simulated_Host() : rm(TVXSIM_LRMAPI), hba(TVXSIM_HBAAPI) { load("default"); }
  ~Simulated_Host() override { tvxsim_load_text("{}"); }

  void load(const std::string& name) {
    const std::string path = std::string(TVXSIM_SCENARIOS) + "/" + name + ".json";
    ASSERT_EQ(tvxsim_load(path.c_str()), 0) << tvxsim_last_error();
  }
  void fault(const char* json) { ASSERT_EQ(tvxsim_add_fault(json), 0) << tvxsim_last_error(); }

  HBA_HANDLE open(const char* name) {
    std::string copy = name;
    return SIM_CALL(hba, HBA_OpenAdapter, copy.data());
  }

  Library rm;
  Library hba;
};

inline HBA_WWN wwn(std::uint64_t number) {
  HBA_WWN name;
  for (int i = 7; i >= 0; --i, number >>= 8) name.wwn[i] = static_cast<HBA_UINT8>(number);
  return name;
}

inline std::uint64_t number(const HBA_WWN& name) {
  std::uint64_t value = 0;
  for (const HBA_UINT8 byte : name.wwn) value = value << 8 | byte;
  return value;
}

// The first port of the default scenario.
inline const HBA_WWN first_port = wwn(0x10000254560C4110ULL);

/// A block of attributes and what it holds.
class Block {
 public:
  explicit Block(const Library& library, std::uint32_t room = 2864)
      : m_Library(library), m_Bytes((room + 15) / 8), size(room) {}

  void* data() { return m_Bytes.data(); }
  bool has(std::uint32_t id) { return value(id) != nullptr; }
  std::uint32_t length(std::uint32_t id) {
    value(id);
    return m_Length;
  }
  std::uint32_t u32(std::uint32_t id) { return read<std::uint32_t>(id); }
  std::uint64_t u64(std::uint32_t id) { return read<std::uint64_t>(id); }
  std::string text(std::uint32_t id) {
    const char* found = static_cast<const char*>(value(id));
    return found == nullptr ? "(missing)" : std::string(found, strnlen(found, m_Length));
  }

 private:
  template <class T>
  T read(std::uint32_t id) {
    T result{};
    const void* found = value(id);
    EXPECT_NE(found, nullptr) << std::hex << id;
    if (found == nullptr) return result;
    EXPECT_EQ(m_Length, sizeof result);
    std::memcpy(&result, found, sizeof result);
    return result;
  }
  const void* value(std::uint32_t id) {
    m_Length = 0;
    RM_STATUS status = 1;
    const void* found = SIM_CALL(m_Library, RM_GetAttributeValue, data(), id, &m_Length, &status);
    EXPECT_EQ(found == nullptr, status != 0);
    return found;
  }

  const Library& m_Library;
  std::vector<std::uint64_t> m_Bytes;
  std::uint32_t m_Length = 0;

 public:
  std::uint32_t size;  ///< handed to the library as the room, in and out
};

}  // namespace tvx::sim_test
