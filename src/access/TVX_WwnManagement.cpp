// World wide names of a port: changing, restoring and reading them.
#include <array>
#include <cstdio>

#include "access/TVX_MethodWrapper.h"
#include "access/TVX_VPortList.h"
#include "common/CLogger.h"
#include "common/TVX_Clock.h"

namespace cimrt {

namespace {

static_assert(sizeof(RM_LocalHBAInfo) == 172 && sizeof(RM_LocalHBASelector) == 8);

constexpr std::uint32_t LIBRARY_FAILURE = 40000;

// --- Calls of a busy adapter ---------------------------------------------------------------------

constexpr int MOST_REPETITIONS = 300;
constexpr std::uint64_t REPETITION_PAUSE = 1'000'000;  // microseconds

/// Calls until the adapter has done its work, and answers the last status.
/// @param repeating logged before the first repetition
/// @param failing logged when a call throws; the status before it stays
template <class Call>
RM_STATUS callWhileBusy(Call call, const char* repeating, const char* failing) {
  RM_STATUS status = RM_ERROR;
  try {
    status = call();
    for (int i = 0; i < MOST_REPETITIONS && status == RM_ERROR_WWN_IN_PROGRESS; ++i) {
      if (i == 0) TVX_LOG(TVX_DBG, "%s", repeating);
      status = call();
      tvxSleep(REPETITION_PAUSE);
    }
  } catch (...) {
    TVX_LOG(TVX_ERR, "%s", failing);
  }
  return status;
}

// --- What a change has to be followed by ---------------------------------------------------------

constexpr const char* REBOOT_TEXT = "Reboot required to activate the new setting";
constexpr const char* VOLATILE_TEXT =
    "Volatile names will be active until system power-down or HBA power-cycle";

/// Texts of one operation status.
struct Activation_Row {
  std::uint32_t operationStatus;
  const char* text;
  bool isVolatile;  ///< VOLATILE_TEXT follows
};

constexpr Activation_Row CHANGE_ACTIVATIONS[] = {
    {5, REBOOT_TEXT, true},
    {6, REBOOT_TEXT, false},
    {7, "Reset required to activate the new setting", true},
    {8, "Reset required to activate the new setting", false},
};

constexpr Activation_Row RESTORE_ACTIVATIONS[] = {
    {5, REBOOT_TEXT, true},
    {6, REBOOT_TEXT, false},
    {7, "Reset the HBA to activate the new setting", true},
    {8, "Please reset the HBA to activate the new setting", false},
};

template <std::size_t N>
const Activation_Row* findActivation(const Activation_Row (&rows)[N], std::uint32_t status) {
  for (const Activation_Row& row : rows)
    if (row.operationStatus == status) return &row;
  return nullptr;
}

void tellActivation(const Activation_Row& row, Property<std::uint16_t>& operationStatus) {
  TVX_LOG(TVX_WARN, "%s", row.text);
  if (row.isVolatile) TVX_LOG(TVX_WARN, "%s", VOLATILE_TEXT);
  operationStatus.set(row.operationStatus);
}

// --- New names that a virtual port has already ---------------------------------------------------

/// Longer lists of virtual ports are not looked through.
constexpr std::uint32_t MOST_VPORTS = 1023;

/// Kinds of duplicates, as `WWNOperationStatus` tells them. Only the first can be found so far.
constexpr std::uint16_t DUPLICATE_VPORT_WWPN = 1;
constexpr std::array<const char*, 5> DUPLICATE_TEXTS = {
    nullptr,
    "ChangeWWN: Duplication of vport WWPN detected.",
    "ChangeWWN: Duplication of vport WWNN detected.",
    "ChangeWWN: Duplication of vport target WWPN detected.",
    "ChangeWWN: Duplication of vport target WWNN detected.",
};

struct New_Names {
  const HBA_WWN& port;
  const HBA_WWN& node;
};

bool isEqual(const HBA_WWN& a, const HBA_WWN& b) {
  return std::equal(std::begin(a.wwn), std::end(a.wwn), std::begin(b.wwn));
}

/// True, with the kind told, if a virtual port of `physical` is named as one of the new names.
bool isVPortName(const HBA_WWN& physical, const New_Names& names, std::uint16_t& kind) {
  const TVX_VPort_List ports = readVPorts(physical, MOST_VPORTS);
  if (!ports.block || ports.status != RM_OK || ports.list().count > MOST_VPORTS) return false;
  for (std::uint32_t i = 0; i < ports.list().count; ++i) {
    const HBA_WWN name = ports.entry(i).wwpn;
    if (!isEqual(name, names.port) && !isEqual(name, names.node)) continue;
    kind = DUPLICATE_VPORT_WWPN;
    return true;
  }
  return false;
}

/// Looks at every local port once. 0 if there is no duplicate, or its kind.
std::uint16_t findDuplicate(const New_Names& names) {
  HBA_WWN** walked = nullptr;
  int walkedCount = 0;
  std::uint16_t kind = 0;
  const std::uint32_t count = RM_GetNumberOfLocalAdapters();
  for (std::uint32_t i = 0; i < count; ++i) {
    RM_LocalHBAInfo info{};
    const RM_LocalHBASelector selector{0, i};
    if (RM_GetLocalHBAInfo(&selector, &info) != RM_OK) continue;
    if (TVX_MethodWrapper::isDuplicateEntryInWWPNList(&info.wwpn, &walked, &walkedCount)) continue;
    isVPortName(info.wwpn, names, kind);
  }
  TVX_MethodWrapper::freeWWPNList(&walked, &walkedCount);
  return kind;
}

// --- The steps of a change -----------------------------------------------------------------------

bool isUsable(const HBA_WWN& name, const char* what) {
  if (RM_ValidateWwn(name) != RM_ERROR_INVALID_WWN) return true;
  TVX_LOG(TVX_ERR, "The supplied 'New %s' is not valid", what);
  return false;
}

void tellChangeFailure(RM_STATUS result) {
  if (result == RM_ERROR_WWN_UNAVAILABLE)
    TVX_LOG(TVX_ERR, "WWN Management is not available on this HBA");
  if (result == RM_ERROR_WWN_NOT_SUPPORTED) TVX_LOG(TVX_ERR, "WWN NOT SUPPORTED");
  TVX_LOG(TVX_ERR, "ChanngeWWN: RM_ChangeWWN call failed with error: %d", result);
}

std::uint32_t methodResult(RM_STATUS status) {
  return LIBRARY_FAILURE + static_cast<std::uint32_t>(status);
}

}  // namespace

void TVX_MethodWrapper::ChangeWWN(const HBA_WWN& wwpn, const HBA_WWN& newWwpn,
                                  const HBA_WWN& newWwnn, std::uint16_t type,
                                  Property<std::uint16_t>& operationStatus,
                                  Property<std::uint32_t>& status) {
  if (!isUsable(newWwpn, "WWPN") || !isUsable(newWwnn, "WWNN")) {
    status.set(methodResult(RM_ERROR_INVALID_WWN));
    return;
  }
  if (const std::uint16_t kind = findDuplicate({newWwpn, newWwnn}); kind != 0) {
    TVX_LOG(TVX_DBG, "%s", DUPLICATE_TEXTS[kind]);
    operationStatus.set(kind);
    status.set(std::uint32_t{RM_ERROR_WWN_DUPLICATE});
    return;
  }
  TVX_LOG(TVX_INFO, "ChangeWWN operation initiated");
  std::uint32_t told = 0;
  const RM_STATUS result =
      callWhileBusy([&] { return LRM_ChangeWWN(wwpn, newWwpn, newWwnn, type, &told); },
                    "Validating new WWNs...", "Error in RM_ChangeWWN");
  if (result != RM_OK) {
    tellChangeFailure(result);
    status.set(methodResult(result));
    return;
  }
  TVX_LOG(TVX_WARN, "New WWNs written successfully");
  if (const Activation_Row* row = findActivation(CHANGE_ACTIVATIONS, told))
    tellActivation(*row, operationStatus);
  status.set(std::uint32_t{0});
}

// --- Restoring -----------------------------------------------------------------------------------

namespace {

constexpr std::uint32_t ALREADY_ACTIVE = 1;

}  // namespace

void TVX_MethodWrapper::RestoreWWN(const HBA_WWN& wwpn, std::uint16_t type,
                                   Property<std::uint16_t>& operationStatus,
                                   Property<std::uint32_t>& status) {
  status.set(std::uint32_t{0});
  TVX_LOG(TVX_INFO, "RestoreWWN operation initiated.");
  std::uint32_t told = 0;
  const RM_STATUS result = callWhileBusy([&] { return LRM_RestoreWWN(wwpn, type, &told); },
                                         "Restoring WWNs...", "Error in RM_RestoreWWN");
  if (result != RM_OK) return;
  if (told == ALREADY_ACTIVE) {
    TVX_LOG(TVX_WARN, "WWNs already active. No Restore needed");
    operationStatus.set(told);
  } else if (const Activation_Row* row = findActivation(RESTORE_ACTIVATIONS, told)) {
    TVX_LOG(TVX_WARN, "WWNs restored successfully");
    tellActivation(*row, operationStatus);
  }
}

// --- Reading -------------------------------------------------------------------------------------

namespace {

enum Read_Type : std::uint16_t { READ_VOLATILE = 0, READ_CONFIGURED = 4 };
constexpr std::uint32_t DO_NOT_EXIST = 9;
/// In place of an operation status: the row tells of every one, which does not go out.
constexpr std::uint32_t ANY_STATUS = 0xFFFFFFFF;

/// What is logged of one answer, whose operation status goes out.
struct Reading_Row {
  std::uint16_t type;
  bool needsSuccess;  ///< only a status of 0 is told of
  std::uint32_t operationStatus;
  int level;
  const char* text;
};

constexpr Reading_Row READINGS[] = {
    {0, true, 1, TVX_INFO, "Volatile WWNs are active"},
    {0, true, DO_NOT_EXIST, TVX_ERR, "Volatile WWNs DO NOT EXIST on this adapter"},
    {1, true, ANY_STATUS, TVX_INFO, "Non-Volatile WWNs read successfully"},
    {2, true, ANY_STATUS, TVX_INFO, "Factory Default WWNs read successfully"},
    {3, false, 3, TVX_INFO, "Current WWNs: Volatile"},
    {3, false, 4, TVX_INFO, "Current WWNs: Non-Volatile"},
    {4, false, DO_NOT_EXIST, TVX_INFO, "Configured WWNs DO NOT EXIST"},
    {4, false, 5, TVX_INFO, "Configured WWNs: Volatile (Activation required: warm reboot)"},
    {4, false, 7, TVX_INFO, "Configured WWNs: Volatile (Activation required: adapter restart)"},
    {4, false, 6, TVX_INFO, "Configured WWNs: Non-Volatile (Activation required: warm reboot)"},
    {4, false, 8, TVX_INFO, "Configured WWNs: Non-Volatile (Activation required: adapter restart)"},
};

void tellReading(std::uint16_t type, RM_STATUS result, std::uint32_t told,
                 Property<std::uint16_t>& operationStatus) {
  for (const Reading_Row& row : READINGS) {
    if (row.type != type || (row.needsSuccess && result != RM_OK)) continue;
    if (row.operationStatus != ANY_STATUS && row.operationStatus != told) continue;
    TVX_LOG(row.level, "%s", row.text);
    if (row.operationStatus != ANY_STATUS) operationStatus.set(told);
  }
}

void tellReadFailure(std::uint16_t type, RM_STATUS result) {
  if (type == READ_VOLATILE && result == RM_ERROR_WWN_NOT_SUPPORTED)
    TVX_LOG(TVX_ERR, "Volatile WWNs are NOT SUPPORTED on this adapter");
  else if (result == RM_ERROR_WWN_UNAVAILABLE)
    TVX_LOG(TVX_ERR, "WWN Management is NOT AVAILABLE on this adapter");
  else
    TVX_LOG(TVX_ERR, "ReadWWN: RM_ReadWWN call failed with error: %d", result);
}

std::array<char, TVX_HBA_NAME_LENGTH + 1> lowerCaseName(const HBA_WWN& wwn) {
  std::array<char, TVX_HBA_NAME_LENGTH + 1> text{};
  const HBA_UINT8* b = wwn.wwn;
  std::snprintf(text.data(), text.size(), "%02x:%02x:%02x:%02x:%02x:%02x:%02x:%02x", b[0], b[1],
                b[2], b[3], b[4], b[5], b[6], b[7]);
  return text;
}

}  // namespace

void TVX_MethodWrapper::ReadWWN(const HBA_WWN& wwpn, std::uint16_t type, Property<String>& wwpnOut,
                                Property<String>& wwnnOut, Property<std::uint16_t>& operationStatus,
                                Property<std::uint32_t>& status) {
  HBA_WWN port{};
  HBA_WWN node{};
  std::uint32_t told = 0;
  const RM_STATUS result = LRM_ReadWWN(wwpn, type, &port, &node, &told);
  tellReading(type, result, told, operationStatus);
  if (type == READ_CONFIGURED && told == DO_NOT_EXIST) {
    status.set(std::uint32_t{0});
    return;
  }
  if (result != RM_OK) {
    tellReadFailure(type, result);
    status.set(methodResult(result));
    return;
  }
  const auto portText = lowerCaseName(port);
  const auto nodeText = lowerCaseName(node);
  TVX_LOG(TVX_DBG, "WWPN: %s", portText.data());
  TVX_LOG(TVX_DBG, "WWNN: %s", nodeText.data());
  wwpnOut.set(portText.data());
  wwnnOut.set(nodeText.data());
  status.set(std::uint32_t{0});
}

// --- Capability ----------------------------------------------------------------------------------

namespace {

/// One bit of a capability: what is logged where it is set, and where it is not.
struct Capability_Row {
  std::uint32_t mask;
  const char* set;
  const char* clear;  ///< null: nothing
};

constexpr Capability_Row CAPABILITIES[] = {
    {0x8000, "Read Only mode: World Wide Name Management is not supported in this mode", nullptr},
    {4, "Can change Non-Volatile WWNs", "Cannot change Non-Volatile WWNs"},
    {8, "Can change Volatile WWNs", "Cannot change Volatile WWNs"},
    {0x1000, "Activation requirement: Reboot", nullptr},
    {0x2000, "Activation requirement: Reset HBA", nullptr},
};

}  // namespace

void TVX_MethodWrapper::GetWWNCapability(const HBA_WWN& wwpn, Property<std::uint32_t>& capability,
                                         Property<std::uint32_t>& status) {
  std::uint32_t bits = 1;
  if (const RM_STATUS result = LRM_GetWWNCapability(wwpn, &bits); result != RM_OK) {
    if (result == RM_ERROR_WWN_UNAVAILABLE)
      TVX_LOG(TVX_ERR, "WWN Management is not available on this HBA");
    TVX_LOG(TVX_ERR, "GetWWNCapability: RM_ReadWWNCapability call failed with error: %d", result);
    status.set(methodResult(result));
    return;
  }
  capability.set(bits);
  for (const Capability_Row& row : CAPABILITIES) {
    const char* text = (bits & row.mask) != 0 ? row.set : row.clear;
    if (text) TVX_LOG(TVX_INFO, "%s", text);
  }
  status.set(std::uint32_t{0});
}

}  // namespace cimrt
