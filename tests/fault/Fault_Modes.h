// The ways in which a management library can fail a caller.
#pragma once

#include <string>
#include <vector>

namespace tvx::test {

struct Fault_Mode {
  std::string name;
  /// Members of a fault besides "call"; empty for a symbol that is missing.
  std::string members;

  bool isMissingSymbol() const { return members.empty(); }
};

/// All of them, the statuses first.
inline std::vector<Fault_Mode> faultModes() {
  std::vector<Fault_Mode> modes;
  for (const int status : {1,  2,  3,  4,  5,  6,  7,   8,   9,   22,  25,  26,  41,  60,  61,
                           64, 77, 91, 97, 98, 99, 101, 144, 145, 148, 149, 150, 151, 247, 31337})
    modes.push_back({"status " + std::to_string(status), R"("status": )" + std::to_string(status)});
  modes.push_back({"status -1", R"("status": -1)"});
  modes.push_back({"first call fails", R"("status": 8, "first": 1)"});
  modes.push_back({"every call but the first fails", R"("status": 1, "from": 2)"});
  modes.push_back({"slow", R"("delay_ms": 20)"});
  modes.push_back({"garbage", R"("garbage": true)"});
  modes.push_back({"texts without an end", R"("unterminated_texts": true)"});
  for (const char* size : {"0", "1", "7"})
    modes.push_back(
        {std::string("only ") + size + " bytes written", std::string(R"("write_only": )") + size});
  for (const char* size : {"0", "1", "1025", "2147483647", "4294967295"}) {
    modes.push_back(
        {std::string("count told as ") + size, std::string(R"("returned_size": )") + size});
    modes.push_back({std::string("too small, wants ") + size,
                     std::string(R"("status": 7, "returned_size": )") + size});
  }
  modes.push_back({"missing symbol", ""});
  return modes;
}

}  // namespace tvx::test
