// Versions, status texts, and what the library knows about local ports.
#include <map>

#include "lrmapi/Call.h"

using namespace tvx::sim;

namespace {

const std::map<RM_STATUS, const char*> status_texts = {
    {RM_OK, "Success"},
    {RM_ERROR, "General error"},
    {2, "Not supported"},
    {RM_ERROR_INVALID_POINTER, "Invalid argument"},
    {RM_ERROR_INVALID_WWN, "World Wide Name not valid"},
    {RM_ERROR_MORE_DATA, "More data available, buffer too small"},
    {RM_ERROR_NO_MEMORY, "Out of memory"},
    {RM_ERROR_DIRECTORY, "Directory cannot be opened"},
    {RM_ERROR_DIAG_NOT_READY, "Diagnostic results not ready"},
    {RM_ERROR_DIAG_TABLE_FULL, "Too many diagnostic requests"},
    {RM_ERROR_DIAG_UNAVAILABLE, "Diagnostics not available"},
    {RM_ERROR_ADAPTER_BUSY, "Adapter busy"},
    {RM_ERROR_WWN_NOT_SUPPORTED, "World Wide Name type not supported"},
    {RM_ERROR_WWN_UNAVAILABLE, "World Wide Name management not available"},
    {RM_ERROR_WWN_IN_PROGRESS, "World Wide Name operation in progress"},
    {RM_ERROR_VPORT_UNSUPPORTED, "Virtual ports not supported on this host"},
    {RM_ERROR_MAILBOX_FAILED, "Mailbox command failed"},
    {RM_ERROR_MAILBOX_TIMEOUT, "Mailbox command timed out"},
    {RM_ERROR_MAILBOX_BUSY, "Mailbox busy"},
    {RM_ERROR_CONFIG_FILE, "Configuration file cannot be opened"},
    {RM_ERROR_CONFIG_FILE_ALT, "Configuration file cannot be opened"},
    {RM_ERROR_SCSI_CHECK, "SCSI check condition"},
    {RM_ERROR_DIAG_PORT, "Diagnostics not supported on this port"},
    {RM_ERROR_LIST_TOO_SMALL, "List buffer too small"},
    {RM_ERROR_BOOT_CODE_ENABLED, "Boot code is enabled on a port function"},
    {RM_NEED_REBOOT, "Completed, reboot required to activate"},
    {RM_ERROR_VERSION_TOO_SMALL, "Version buffer too small"},
};

}  // namespace

extern "C" {

RM_STATUS RM_StatusString(RM_STATUS status, char* text, uint32_t size) {
  return rm_call(Call_Site{.name = "RM_StatusString"},
                 [=](World&, const Fault_Effect& effect) -> RM_STATUS {
                   if (text == nullptr || size == 0) return RM_ERROR;
                   const auto found = status_texts.find(status);
                   write_text(text, size, found == status_texts.end() ? "" : found->second, effect);
                   return RM_OK;
                 });
}

RM_STATUS RM_MiliVersion(char* text, uint32_t size) {
  return rm_call(Call_Site{.name = "RM_MiliVersion"},
                 [=](const World& world, const Fault_Effect& effect) {
                   return answer_text(world.library.mili_version, text, size, effect);
                 });
}

RM_STATUS RM_GetVersion(int selector, char* text, uint32_t* size) {
  return rm_call(
      Call_Site{.name = "RM_GetVersion"},
      [=](const World& world, const Fault_Effect& effect) -> RM_STATUS {
        const auto& versions = world.library.versions;
        const auto found = versions.find(static_cast<std::uint32_t>(selector));
        if (size == nullptr || found == versions.end()) return RM_ERROR;
        const RM_STATUS status = answer_text(found->second, text, *size, effect);
        *size = effect.returned_size.value_or(static_cast<std::uint32_t>(found->second.size() + 1));
        return status;
      });
}

RM_STATUS RM_IsLocalHBA(HBA_WWN wwpn, uint32_t* local) {
  const Wwn name = to_wwn(wwpn);
  return rm_call(Call_Site{.name = "RM_IsLocalHBA", .port = name},
                 [&](World& world, const Fault_Effect&) -> RM_STATUS {
                   if (local == nullptr) return RM_ERROR;
                   *local = world.find_port(name) != nullptr ? 1 : 0;
                   return RM_OK;
                 });
}

RM_STATUS RM_ValidateWwn(HBA_WWN wwn) {
  const Wwn name = to_wwn(wwn);
  return rm_call(
      Call_Site{.name = "RM_ValidateWwn"}, [&](World&, const Fault_Effect&) -> RM_STATUS {
        // Names of the formats 1, 2 and 5 of the Fibre Channel standards name a port or a node.
        const unsigned format = name[0] >> 4;
        const bool valid = (format == 1 || format == 2 || format == 5) && wwn_number(name) != 0;
        return valid ? RM_OK : RM_ERROR_INVALID_WWN;
      });
}

uint32_t RM_GetNumberOfLocalAdapters(void) {
  std::uint32_t count = 0;
  const RM_STATUS status = rm_call(Call_Site{.name = "RM_GetNumberOfLocalAdapters"},
                                   [&count](const World& world, const Fault_Effect&) {
                                     count = static_cast<std::uint32_t>(world.ports.size());
                                     return RM_OK;
                                   });
  return status == RM_OK ? count : 0;
}

RM_STATUS RM_GetLocalHBAInfo(const RM_LocalHBASelector* selector, RM_LocalHBAInfo* info) {
  return rm_call(Call_Site{.name = "RM_GetLocalHBAInfo"},
                 [=](const World& world, const Fault_Effect&) -> RM_STATUS {
                   if (selector == nullptr || info == nullptr) return RM_ERROR;
                   if (selector->index >= world.ports.size()) return RM_ERROR;
                   std::memset(info, 0, sizeof *info);
                   info->wwpn = from_wwn(world.ports[selector->index].names.port);
                   return RM_OK;
                 });
}

}  // extern "C"
