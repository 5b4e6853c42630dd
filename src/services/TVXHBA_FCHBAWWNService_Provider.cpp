#include "services/TVXHBA_FCHBAWWNService_Provider.h"

#include <cstddef>

#include "access/TVX_MethodWrapper.h"
#include "services/Service_Checks.h"

namespace cimrt {

namespace {

constexpr std::uint32_t EMPTY_NAME = 32969;
constexpr std::uint32_t UNKNOWN_TYPE = 32968;
/// What `WWNOperationStatus` starts as.
constexpr std::uint16_t NO_OPERATION_STATUS = 65535;

constexpr const char* OWNER = "TVXHBA_FCHBAWWNService_Provider";
constexpr Service_Texts TEXTS = {"Invalid instance of HBA WWN Management Service",
                                 "TVXHBA_FCHBAWWNService_Provider invald port ...return", OWNER};

/// The types of one method: what is logged of each, by number.
struct Type_Table {
  const char* method;
  int level;
  const char* const* texts;
  std::size_t count;
};

constexpr const char* CHANGE_TEXTS[] = {"Writing Volatile World Wide Name.",
                                        "Writing Non-Volatile World Wide Name."};
constexpr const char* RESTORE_TEXTS[] = {"Restoring Factory Default World Wide Name...",
                                         "Restoring Non-volatile World Wide Name..."};
constexpr const char* READ_TEXTS[] = {"Reading Volatile WWNs.", "Reading Non-Volatile WWNs.",
                                      "Reading Factory Default WWNs.", "Reading current WWNs.",
                                      "Reading configured WWNs."};

constexpr Type_Table CHANGE_TYPES = {"ChangeWWN", TVX_DBG, CHANGE_TEXTS, std::size(CHANGE_TEXTS)};
constexpr Type_Table RESTORE_TYPES = {"RestoreWWN", TVX_INFO, RESTORE_TEXTS,
                                      std::size(RESTORE_TEXTS)};
constexpr Type_Table READ_TYPES = {"ReadWWN", TVX_DBG, READ_TEXTS, std::size(READ_TEXTS)};

std::uint32_t checkType(const Type_Table& types, std::uint16_t type) {
  if (type < types.count) {
    TVX_LOG(types.level, "%s", types.texts[type]);
    return METHOD_OK;
  }
  TVX_LOG(TVX_ERR, "%s: Type %d not recognized...", types.method, static_cast<int>(type));
  return UNKNOWN_TYPE;
}

std::uint32_t openCall(Service_Call& call, const TVXHBA_FCHBAWWNService* service,
                       const TVXHBA_FCPort* target, HBA_WWN& wwpn) {
  return openServiceCall(call.agent, call.agent.m_TVXHBA_FCHBAWWNService_map, service, target,
                         TEXTS, wwpn);
}

bool isEmpty(const Property<String>& name, const char* what) {
  if (!name.is_null() && !name.value.empty()) return false;
  TVX_LOG(TVX_ERR, "New %s has a null pointer", what);
  return true;
}

std::uint32_t takeNewNames(const Property<String>& newWWPN, const Property<String>& newWWNN,
                           HBA_WWN& port, HBA_WWN& node) {
  if (isEmpty(newWWPN, "WWPN") || isEmpty(newWWNN, "WWNN")) return EMPTY_NAME;
  const bool converted =
      convertPortName(OWNER, newWWPN, port) && convertPortName(OWNER, newWWNN, node);
  return converted ? METHOD_OK : METHOD_UNKNOWN_PORT;
}

/// Asks for a rebuild of the cache. No agent lock may be held.
void refresh() {
  ProviderAgent& agent = *ProviderAgent::getInstance();
  agent.m_bAdapterRefreshPending = true;
  agent.BuildCimrtInfo();
}

/// `ChangeWWN` under the agent's data lock.
void changeNames(const TVXHBA_FCHBAWWNService* service, const TVXHBA_FCPort* target,
                 const Property<String>& newWWPN, const Property<String>& newWWNN,
                 std::uint16_t type, Property<std::uint16_t>& operationStatus,
                 Property<std::uint32_t>& result) {
  Service_Call call;
  HBA_WWN wwpn{};
  HBA_WWN port{};
  HBA_WWN node{};
  result.set(openCall(call, service, target, wwpn));
  if (result.value == METHOD_OK) result.set(takeNewNames(newWWPN, newWWNN, port, node));
  if (result.value == METHOD_OK) result.set(checkType(CHANGE_TYPES, type));
  if (result.value != METHOD_OK) return;
  TVX_MethodWrapper::ChangeWWN(wwpn, port, node, type, operationStatus, result);
  if (result.value != METHOD_OK) return;
  TVX_LOG(TVX_INFO,
          "ChangeWWN operation completed. Please restart the CIMOM to use Torvex CIM provider");
}

/// `RestoreWWN` under the agent's data lock.
void restoreNames(const TVXHBA_FCHBAWWNService* service, const TVXHBA_FCPort* target,
                  std::uint16_t type, Property<std::uint16_t>& operationStatus,
                  Property<std::uint32_t>& result) {
  Service_Call call;
  HBA_WWN wwpn{};
  result.set(openCall(call, service, target, wwpn));
  if (result.value == METHOD_OK) result.set(checkType(RESTORE_TYPES, type));
  if (result.value != METHOD_OK) return;
  TVX_MethodWrapper::RestoreWWN(wwpn, type, operationStatus, result);
}

}  // namespace

std::int32_t TVXHBA_FCHBAWWNService_Provider::ChangeWWN(const TVXHBA_FCHBAWWNService* service,
                                                        const TVXHBA_FCPort* target,
                                                        const Property<String>& newWWPN,
                                                        const Property<String>& newWWNN,
                                                        const Property<std::uint16_t>& type,
                                                        Property<std::uint16_t>& operationStatus,
                                                        Property<std::uint32_t>& return_value) {
  TVX_LOG(TVX_DBG, "Entering ChangeWWN");
  operationStatus.set(NO_OPERATION_STATUS);
  changeNames(service, target, newWWPN, newWWNN, type.value, operationStatus, return_value);
  if (return_value.value == METHOD_OK) refresh();
  return INVOKE_METHOD_OK;
}

std::int32_t TVXHBA_FCHBAWWNService_Provider::RestoreWWN(const TVXHBA_FCHBAWWNService* service,
                                                         const TVXHBA_FCPort* target,
                                                         const Property<std::uint16_t>& type,
                                                         Property<std::uint16_t>& operationStatus,
                                                         Property<std::uint32_t>& return_value) {
  TVX_LOG(TVX_DBG, "Entering RestoreWWN");
  operationStatus.set(NO_OPERATION_STATUS);
  restoreNames(service, target, type.value, operationStatus, return_value);
  if (return_value.value == METHOD_OK) refresh();
  return INVOKE_METHOD_OK;
}

std::int32_t TVXHBA_FCHBAWWNService_Provider::ReadWWN(
    const TVXHBA_FCHBAWWNService* service, const TVXHBA_FCPort* target,
    const Property<std::uint16_t>& type, Property<String>& wwpn, Property<String>& wwnn,
    Property<std::uint16_t>& operationStatus, Property<std::uint32_t>& return_value) {
  TVX_LOG(TVX_DBG, "Entering ReadWWN");
  operationStatus.set(NO_OPERATION_STATUS);
  Service_Call call;
  HBA_WWN port{};
  return_value.set(openCall(call, service, target, port));
  if (return_value.value == METHOD_OK) return_value.set(checkType(READ_TYPES, type.value));
  if (return_value.value == METHOD_OK)
    TVX_MethodWrapper::ReadWWN(port, type.value, wwpn, wwnn, operationStatus, return_value);
  return INVOKE_METHOD_OK;
}

std::int32_t TVXHBA_FCHBAWWNService_Provider::GetWWNCapability(
    const TVXHBA_FCHBAWWNService* service, const TVXHBA_FCPort* target,
    Property<std::uint32_t>& capability, Property<std::uint32_t>& return_value) {
  TVX_LOG(TVX_DBG, "Entering GetWWNCapability");
  Service_Call call;
  HBA_WWN wwpn{};
  return_value.set(openCall(call, service, target, wwpn));
  if (return_value.value == METHOD_OK)
    TVX_MethodWrapper::GetWWNCapability(wwpn, capability, return_value);
  return INVOKE_METHOD_OK;
}

}  // namespace cimrt
