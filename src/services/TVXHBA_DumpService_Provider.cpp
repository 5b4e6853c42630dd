#include "services/TVXHBA_DumpService_Provider.h"

#include <algorithm>
#include <cstddef>
#include <cstring>
#include <string_view>

#include "access/TVX_MethodWrapper.h"
#include "services/Service_Checks.h"

namespace cimrt {

namespace {

constexpr Service_Texts TEXTS = {"Invalid instance of TVXHBA_DumpService",
                                 "TVXHBA_DumpService invald port ...return", "TVXHBA_DumpService"};

std::uint32_t openCall(Service_Call& call, const TVXHBA_DumpService* service,
                       const TVXHBA_FCPort* target, HBA_WWN& wwpn) {
  return openServiceCall(call.agent, call.agent.m_TVXHBA_DumpService_map, service, target, TEXTS,
                         wwpn);
}

/// Logs the outcome of one operation and answers the result of the method.
std::uint32_t finish(RM_STATUS status, const char* operation, const char* method) {
  if (status != RM_OK) {
    TVX_LOG(TVX_ERR, "TVXHBA_DumpService::%s failed", operation);
    return METHOD_LIBRARY_FAILURE + static_cast<std::uint32_t>(status);
  }
  TVX_LOG(TVX_DBG, "TVXHBA_DumpService::%s Succesful", operation);
  TVX_LOG(TVX_DBG, "returning from TVXHBA_DumpService::%s", method);
  return METHOD_OK;
}

// --- Lists of names ------------------------------------------------------------------------------

constexpr std::size_t NAME_SIZE = sizeof(RM_DumpFileNames::name[0]);
constexpr std::size_t LIST_HEAD = offsetof(RM_DumpFileNames, name);
constexpr std::uint32_t FIRST_ROOM = 4;
/// A list that claims more is taken for memory that there is not.
constexpr std::uint32_t MOST_NAMES = 65536;

static_assert(LIST_HEAD + FIRST_ROOM * NAME_SIZE == 1032);

/// Accepted ends of a name.
constexpr std::string_view ENDINGS[] = {".fat", "core", ".efd", ".txt", ".dmp", ".cee", ".bin"};

bool isDump(std::string_view name) {
  return std::any_of(std::begin(ENDINGS), std::end(ENDINGS),
                     [name](std::string_view ending) { return name.ends_with(ending); });
}

struct Name_List {
  TVX_Block block{};
  std::uint32_t room = 0;
  RM_DumpFileNames* names() const { return reinterpret_cast<RM_DumpFileNames*>(block.get()); }
  /// How many names can be read.
  std::uint32_t size() const { return std::min(names()->count, room); }
  String name(std::uint32_t i) const {
    const auto* text = reinterpret_cast<const char*>(block.get()) + LIST_HEAD + i * NAME_SIZE;
    return String(text, ::strnlen(text, NAME_SIZE));
  }
};

/// Room for so many names, with a block of null without memory.
Name_List allocateNames(std::uint32_t room) {
  Name_List list{room <= MOST_NAMES ? tvxAllocate(LIST_HEAD + room * NAME_SIZE) : nullptr, room};
  if (list.block) list.names()->count = room;
  return list;
}

/// Reads the list, once more if there are more names than the first room holds. METHOD_OK, or the
/// result of the method.
std::uint32_t readNames(const HBA_WWN& wwpn, Name_List& list) {
  list = allocateNames(FIRST_ROOM);
  if (!list.block) return METHOD_UNKNOWN_PORT;
  TVX_LOG(TVX_DBG, "Calling the Get Dump filenames method");
  RM_STATUS status = TVX_MethodWrapper::GetDumpFileNames(wwpn, list.names());
  if (status == RM_ERROR_LIST_TOO_SMALL) {
    list = allocateNames(list.names()->count);
    if (!list.block) return METHOD_UNKNOWN_PORT;
    status = TVX_MethodWrapper::GetDumpFileNames(wwpn, list.names());
  }
  if (status == RM_OK) return METHOD_OK;
  TVX_LOG(TVX_ERR, "TVXHBA_DumpService::tvxcimGetDumpFileNames failed");
  return METHOD_LIBRARY_FAILURE + static_cast<std::uint32_t>(status);
}

void takeNames(const Name_List& list, Property<Array<String>>& files) {
  TVX_LOG(TVX_DBG, "GetDumpFileNames Succesful, NumberOfFileEntries : %d",
          static_cast<int>(list.size()));
  files.value.clear();
  for (std::uint32_t i = 0; i < list.size(); i++) {
    const String name = list.name(i);
    TVX_LOG(TVX_DBG, "Filenames = %s", name.c_str());
    if (!isDump(name.c_str())) continue;
    TVX_LOG(TVX_DBG, "Filename[%d] = %s", static_cast<int>(i), name.c_str());
    files.append(name);
  }
}

}  // namespace

std::int32_t TVXHBA_DumpService_Provider::GenerateDump(const TVXHBA_DumpService* service,
                                                       const TVXHBA_FCPort* target,
                                                       Property<std::uint32_t>& return_value) {
  TVX_LOG(TVX_DBG, "Entering GenerateDump");
  Service_Call call;
  HBA_WWN wwpn{};
  return_value.set(openCall(call, service, target, wwpn));
  if (return_value.value == METHOD_OK)
    return_value.set(finish(TVX_MethodWrapper::tvxcimDumpDiagnostic(wwpn, TVX_WHOLE_DUMP),
                            "tvxcimDumpDiagnostic", "GenerateDump"));
  return INVOKE_METHOD_OK;
}

std::int32_t TVXHBA_DumpService_Provider::DeleteDump(const TVXHBA_DumpService* service,
                                                     const TVXHBA_FCPort* target,
                                                     Property<std::uint32_t>& return_value) {
  TVX_LOG(TVX_DBG, "Entering DeleteDump");
  Service_Call call;
  HBA_WWN wwpn{};
  return_value.set(openCall(call, service, target, wwpn));
  if (return_value.value == METHOD_OK)
    return_value.set(finish(TVX_MethodWrapper::tvxcimDeleteDumpFiles(wwpn), "tvxcimDeleteDumpFiles",
                            "DeleteDump"));
  return INVOKE_METHOD_OK;
}

std::int32_t TVXHBA_DumpService_Provider::GetDumpFileNames(const TVXHBA_DumpService* service,
                                                           const TVXHBA_FCPort* target,
                                                           Property<Array<String>>& files,
                                                           Property<std::uint32_t>& return_value) {
  TVX_LOG(TVX_DBG, "Entering GetDumpFileNames method");
  Service_Call call;
  HBA_WWN wwpn{};
  Name_List list;
  return_value.set(openCall(call, service, target, wwpn));
  if (return_value.value == METHOD_OK) return_value.set(readNames(wwpn, list));
  if (return_value.value == METHOD_OK) takeNames(list, files);
  return INVOKE_METHOD_OK;
}

}  // namespace cimrt
