// Dump files of a port, and the settings of extended event logging.
#include "lrmapi/Call.h"

using namespace tvx::sim;

namespace {

constexpr uint32_t most_kept = 20;

// Adds a file and forgets the oldest ones beyond the retention count.
RM_STATUS add_dump(Port& port, const char* suffix) {
  Dump_Store& dumps = port.dumps;
  char name[96];
  std::string digits;
  for (const char c : format_wwn(port.names.port)) {
    if (c != ':') digits += c;
  }
  std::snprintf(name, sizeof name, "%s_%06u%s", digits.c_str(), ++dumps.made, suffix);
  dumps.files.emplace_back(name);
  while (dumps.files.size() > dumps.retention) dumps.files.erase(dumps.files.begin());
  return RM_OK;
}

// A call that only has to name a local port.
RM_STATUS accepted(const char* name, const HBA_WWN& wwpn) {
  return port_call(name, wwpn, [](World&, const Port&, const Fault_Effect&) { return RM_OK; });
}

}  // namespace

extern "C" {

RM_STATUS LRM_GenerateDump(int, HBA_WWN wwpn) {
  return port_call("LRM_GenerateDump", wwpn,
                   [](World&, Port& port, const Fault_Effect&) { return add_dump(port, ".dmp"); });
}

RM_STATUS LRM_GenerateEfdDump(HBA_WWN wwpn, int, int) {
  return port_call("LRM_GenerateEfdDump", wwpn,
                   [](World&, Port& port, const Fault_Effect&) { return add_dump(port, ".efd"); });
}

RM_STATUS LRM_GenerateCoreDump(HBA_WWN wwpn, const char* options) {
  return port_call("LRM_GenerateCoreDump", wwpn,
                   [=](World&, Port& port, const Fault_Effect&) -> RM_STATUS {
                     if (options == nullptr) return RM_ERROR;
                     return add_dump(port, ".core");
                   });
}

RM_STATUS LRM_RetrieveFATDump(HBA_WWN wwpn) {
  return port_call("LRM_RetrieveFATDump", wwpn,
                   [](World&, Port& port, const Fault_Effect&) { return add_dump(port, ".fat"); });
}

RM_STATUS LRM_RetrieveFATDump2(HBA_WWN wwpn) {
  return port_call("LRM_RetrieveFATDump2", wwpn,
                   [](World&, Port& port, const Fault_Effect&) { return add_dump(port, ".fat"); });
}

RM_STATUS LRM_GetDumpDirectoryA(HBA_WWN wwpn, char* directory, uint32_t size) {
  return port_call("LRM_GetDumpDirectoryA", wwpn,
                   [=](World&, const Port& port, const Fault_Effect& effect) {
                     return answer_text(port.dumps.directory, directory, size, effect);
                   });
}

RM_STATUS LRM_SetDumpDirectory(HBA_WWN wwpn, const char* directory) {
  return port_call("LRM_SetDumpDirectory", wwpn,
                   [=](World&, Port& port, const Fault_Effect&) -> RM_STATUS {
                     if (directory == nullptr || directory[0] != '/') return RM_ERROR_DIRECTORY;
                     port.dumps.directory = directory;
                     return RM_OK;
                   });
}

RM_STATUS LRM_GetDumpFileNames(HBA_WWN wwpn, RM_DumpFileNames* names) {
  return port_call("LRM_GetDumpFileNames", wwpn,
                   [=](World&, const Port& port, const Fault_Effect& effect) -> RM_STATUS {
                     if (names == nullptr) return RM_ERROR;
                     const std::vector<std::string>& files = port.dumps.files;
                     const std::size_t room = names->count;
                     names->count =
                         effect.returned_size.value_or(static_cast<std::uint32_t>(files.size()));
                     if (files.size() > room) return RM_ERROR_LIST_TOO_SMALL;
                     char* slot = names->name[0];
                     for (const std::string& file : files) {
                       write_text(slot, sizeof names->name[0], file, effect);
                       slot += sizeof names->name[0];
                     }
                     return RM_OK;
                   },
                   {.told = names == nullptr ? nullptr : &names->count});
}

RM_STATUS LRM_DeleteDumpFiles(HBA_WWN wwpn) {
  return port_call("LRM_DeleteDumpFiles", wwpn, [](World&, Port& port, const Fault_Effect&) {
    port.dumps.files.clear();
    return RM_OK;
  });
}

RM_STATUS LRM_GetDumpRetentionCount(HBA_WWN wwpn, uint32_t* count) {
  return port_call("LRM_GetDumpRetentionCount", wwpn,
                   [=](World&, const Port& port, const Fault_Effect&) -> RM_STATUS {
                     if (count == nullptr) return RM_ERROR;
                     *count = port.dumps.retention;
                     return RM_OK;
                   });
}

RM_STATUS LRM_SetDumpRetentionCount(HBA_WWN wwpn, uint32_t count) {
  return port_call("LRM_SetDumpRetentionCount", wwpn,
                   [=](World&, Port& port, const Fault_Effect&) -> RM_STATUS {
                     if (count == 0 || count > most_kept) return RM_ERROR;
                     port.dumps.retention = count;
                     return RM_OK;
                   });
}

RM_STATUS LRM_Get_BE_EventLogConfigDataAll(HBA_WWN wwpn, RM_EventLogConfig* config) {
  return port_call("LRM_Get_BE_EventLogConfigDataAll", wwpn,
                   [=](World&, const Port&, const Fault_Effect& effect) -> RM_STATUS {
                     if (config == nullptr) return RM_ERROR;
                     std::memset(config, 0, sizeof *config);
                     config->capacity = 64;
                     config->count = effect.returned_size.value_or(3);
                     return RM_OK;
                   },
                   {.told = config == nullptr ? nullptr : &config->count});
}

RM_STATUS LRM_Set_BE_EventLogConfigDataModule(HBA_WWN wwpn, const RM_EventLogModule* module) {
  if (module == nullptr) return RM_ERROR;
  return accepted("LRM_Set_BE_EventLogConfigDataModule", wwpn);
}

RM_STATUS LRM_Set_BE_EventLogTraceLevel(HBA_WWN wwpn, uint32_t, uint32_t, uint32_t, uint32_t) {
  return accepted("LRM_Set_BE_EventLogTraceLevel", wwpn);
}

RM_STATUS LRM_Set_BE_DefaultLoggingConfig(HBA_WWN wwpn) {
  return accepted("LRM_Set_BE_DefaultLoggingConfig", wwpn);
}

}  // extern "C"
