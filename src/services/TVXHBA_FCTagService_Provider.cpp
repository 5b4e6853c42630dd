#include "services/TVXHBA_FCTagService_Provider.h"

#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <exception>
#include <new>
#include <string>
#include <string_view>

#include "access/TVX_MethodWrapper.h"
#include "common/TVX_Clock.h"
#include "common/TVX_File.h"
#include "common/TVX_Path.h"
#include "common/TVX_Uri.h"
#include "runtime/Safe_Open.h"
#include "services/Service_Checks.h"
#include "services/TVX_ConfigTable.h"

namespace cimrt {

namespace {

constexpr std::uint32_t LIBRARY_FAILED = 1;
constexpr std::uint32_t CANNOT_STAT = 5;
constexpr std::uint32_t NO_TARGET_OR_URI = 4097;
constexpr std::uint32_t FILE_NOT_FOUND = 4107;
constexpr std::uint32_t NO_ENTRIES = 32767;
constexpr std::uint32_t NO_ADAPTERS = 32768;
constexpr std::uint32_t NOT_OPENED = 32968;

constexpr std::size_t NAME_LENGTH = 31;        ///< of an adapter's name or a device id
constexpr std::size_t DIRECTORY_LENGTH = 255;  ///< of a dump directory

std::string cutText(const Property<String>& text, std::size_t most) {
  return text.is_null() ? std::string() : std::string(text.value.c_str()).substr(0, most);
}

// --- Opening -------------------------------------------------------------------------------------

/// What every method does first; METHOD_OK, or its result.
std::uint32_t openCall(ProviderAgent& agent, const TVXHBA_FCTagService* service,
                       const TVXHBA_FCPort* target, const TVXHBA_FCPort*& port) {
  if (!isKnownService(agent.m_TVXHBA_FCTagService_map, service)) {
    TVX_LOG(TVX_ERR, "Invalid instance of FC Tagging Service");
    return METHOD_UNKNOWN_SERVICE;
  }
  if (!target) {
    TVX_LOG(TVX_ERR, "Target has a null pointer");
    return NO_TARGET_OR_URI;
  }
  port = findTargetPort(agent, target);
  if (port) return METHOD_OK;
  TVX_LOG(TVX_ERR, "TVXHBA_FCTagService_Provider::Wrong DeviceID passed");
  return METHOD_UNKNOWN_PORT;
}

/// Name of the adapter of a port: of the last entry with its device id.
std::string adapterName(ProviderAgent& agent, const TVXHBA_FCPort& port) {
  std::string name;
  auto& ports = agent.m_TVXHBA_FCPort_map;
  for (std::size_t i = 0; i < ports.size(); i++) {
    const Property<String>& id = ports[i]->DeviceID;
    if (id.is_null() || !id.value.equal(port.DeviceID.value.c_str())) continue;
    name = cutText(ports[i]->AdapterName, NAME_LENGTH);
    TVX_LOG(TVX_DBG, "TVXHBA_FCTagService_Provider::Successfully got AdapterName,%s", name.c_str());
  }
  return name;
}

/// An adapter of the tagging library, open as long as this object is.
class Tag_Adapter {
 public:
  /// @param failure format of what is logged when it does not open, of the adapter's name
  Tag_Adapter(ProviderAgent& agent, const TVXHBA_FCPort& port, const char* failure) {
    const std::string name = adapterName(agent, port);
    const std::uint32_t count = CPQFC_GetNumberOfAdapters();
    if (count == 0) {
      TVX_LOG(TVX_DBG,
              "TVXHBA_FCTagService_Provider::CPQFC_GetNumberOfAdapters()- No Adapters found");
      result = NO_ADAPTERS;
      return;
    }
    TVX_LOG(TVX_DBG, "TVXHBA_FCTagService_Provider::CPQFC_GetNumberOfAdapters Successful:%d",
            static_cast<int>(count));
    handle = CPQFC_OpenAdapter(name.c_str());
    if (handle != 0) return;
    TVX_LOG(TVX_DBG, "%s%s", failure, name.c_str());
    result = NOT_OPENED;
  }
  ~Tag_Adapter() {
    if (handle != 0) CPQFC_CloseAdapter(handle);
  }
  Tag_Adapter(const Tag_Adapter&) = delete;
  Tag_Adapter& operator=(const Tag_Adapter&) = delete;

  std::uint32_t result = METHOD_OK;  ///< of the method, if it did not open
  HBA_HANDLE handle = 0;
};

// --- The global flag -----------------------------------------------------------------------------

std::uint32_t getFlag(ProviderAgent& agent, const TVXHBA_FCPort& port,
                      Property<std::uint32_t>& state) {
  TVX_LOG(TVX_DBG, "TVXHBA_FCTagService_Provider: Inside GetGlobalFlag");
  const Tag_Adapter adapter(agent, port,
                            "TVXHBA_FCTagService_Provider::Failed to Open Adapter, Skipping "
                            "GetGlobalFlag Adapter Name:");
  if (adapter.result != METHOD_OK) return adapter.result;
  std::uint32_t value = 0;
  if (const int error = CPQFC_QoSGetGlobalFlag(adapter.handle, &value); error != 0) {
    TVX_LOG(TVX_ERR, "TVXHBA_FCTagService_Provider::CPQFC_QoSGetGlobalFlag Failed with Error :%d",
            error);
    return LIBRARY_FAILED;
  }
  state.set(value);
  TVX_LOG(TVX_DBG, "TVXHBA_FCTagService_Provider::GetGlobalFlag Successful");
  return METHOD_OK;
}

std::uint32_t setFlag(ProviderAgent& agent, const TVXHBA_FCPort& port, std::uint32_t state) {
  TVX_LOG(TVX_DBG, "TVXHBA_FCTagService_Provider: Inside SetGlobalFlag");
  const Tag_Adapter adapter(agent, port,
                            "ERROR:TVXHBA_FCTagService_Provider::Failed to Open Adapter, Skipping "
                            "SetGlobalFlag Adapter Name:");
  if (adapter.result != METHOD_OK) return adapter.result;
  if (const int error = CPQFC_QoSSetGlobalFlag(adapter.handle, state); error != 0) {
    TVX_LOG(TVX_ERR, "TVXHBA_FCTagService_Provider::CPQFC_QoSSetGlobalFlag Failed with Error :%d",
            error);
    return LIBRARY_FAILED;
  }
  TVX_LOG(TVX_DBG, "TVXHBA_FCTagService_Provider::SetGlobalFlag Successful");
  return METHOD_OK;
}

// --- From the library into a file ----------------------------------------------------------------

/// The dump directory that was found last, by any call of the process: a port without dump settings
/// gets its file there. Guarded by the agent's data lock.
std::string& lastDumpPath() {
  static std::string path;
  return path;
}

void takeDumpPath(ProviderAgent& agent, const std::string& deviceID) {
  auto& settings = agent.m_TVXHBA_DumpData_map;
  for (std::size_t i = 0; i < settings.size(); i++) {
    const Property<String>& name = settings[i]->ElementName;
    if (name.is_null() || !name.value.equal(deviceID.c_str())) continue;
    lastDumpPath() = cutText(settings[i]->DumpDirectory, DIRECTORY_LENGTH);
    TVX_LOG(TVX_DBG, "TVXHBA_FCTagService_Provider::Successfully got DumpPath,%s",
            lastDumpPath().c_str());
  }
}

/// True for a name whose file lies below the folder that it is put behind.
bool staysBelow(std::string_view name) {
  if (name.front() == '/') return false;
  while (true) {
    const std::size_t slash = name.find('/');
    if (name.substr(0, slash).compare("..") == 0) return false;
    if (slash == std::string_view::npos) return true;
    name.remove_prefix(slash + 1);
  }
}

std::string outputPath(const char* name) {
  const std::string& folder = lastDumpPath();
  return (folder.empty() ? tvxPath("/tmp") : folder) + "/" + name;
}

/// Empty, with the failure logged, if the machine does not tell its name.
std::string hostName() {
  char name[512] = {};
  if (::gethostname(name, sizeof name - 1) != 0)
    TVX_LOG(TVX_ERR,
            "TVXHBA_FCTagService_Provider::gethostname() failed err : %d , using 'unknown' for "
            "hostname and IP address",
            errno);
  return name;
}

std::string timeText() {
  char text[Datetime::ASCII_SIZE] = {};
  tvxNowDatetime().ascii(text, false);
  return text;
}

bool writeFile(const std::string& path, const std::string& text) {
  TVX_File stream(open_for_writing(path.c_str(), "w", LOG_PERMISSIONS));
  return stream && std::fwrite(text.data(), 1, text.size(), stream.get()) == text.size() &&
         std::fflush(stream.get()) == 0;
}

void writeTable(const TVX_QoSTable& table, const char* name, const std::string& deviceID) {
  const std::string path = outputPath(name);
  TVX_LOG(TVX_DBG, "GetConfigTable: filename :%s",
          outputPath(tvxWithoutPassword(name).c_str()).c_str());
  writeFile(path, {});  // the file is there, and empty, whatever becomes of the document
  TVX_LOG(TVX_DBG, "TVXHBA_FCTagService_Provider::WriteConfigTablesToFile");
  const std::string text = writeConfigTable(table, {timeText(), hostName(), deviceID});
  if (!writeFile(path, text)) TVX_LOG(TVX_ERR, "TVXHBA_FCTagService_Provider::file.fail()");
}

/// `writeTable`, with its exceptions logged. True without one.
bool tryToWriteTable(const TVX_QoSTable& table, const char* name, const std::string& deviceID) {
  try {
    writeTable(table, name, deviceID);
    return true;
  } catch (const std::bad_alloc&) {
    TVX_LOG(TVX_DBG, "TVXHBA_FCTagService_Provider: GetConfigTable Memory allocation failed");
  } catch (const std::exception& exception) {
    TVX_LOG(TVX_DBG, "TVXHBA_FCTagService_Provider: GETConfigTable execption: %s",
            exception.what());
  } catch (...) {
    TVX_LOG(TVX_DBG, "TVXHBA_FCTagService_Provider: GetConfigTable unknown exectiion is caught");
  }
  return false;
}

/// Reads the table of an adapter. METHOD_OK, or the result of the method.
std::uint32_t fetchTable(HBA_HANDLE handle, TVX_QoSTable& table) {
  CPQFC_QoSTable question{};
  const int asked = CPQFC_QoSGetConfig(handle, &question);
  if (asked == 0 && question.numberOfEntries == 0) {
    TVX_LOG(TVX_DBG, "TVXHBA_FCTagService_Provider:: CPQFC_QoSGetConfig - No Config Entries set ");
    return NO_ENTRIES;
  }
  table = TVX_QoSTable(question.numberOfEntries);
  if (!table) {
    TVX_LOG(TVX_DBG, "TVXHBA_FCTagService_Provider:: Memory Allocation failed for pQosConfig");
    return LIBRARY_FAILED;
  }
  if (const int error = CPQFC_QoSGetConfig(handle, table.get()); error != 0) {
    TVX_LOG(TVX_DBG, "TVXHBA_FCTagService_Provider:: CPQFC_QoSGetConfig failed with an error :%d ",
            error);
    return LIBRARY_FAILED;
  }
  return METHOD_OK;
}

bool isUsableName(const Property<String>& uri) {
  if (uri.is_null() || uri.value.empty()) {
    TVX_LOG(TVX_ERR, "Null sized URI..returning");
    return false;
  }
  if (staysBelow(uri.value.c_str())) return true;
  TVX_LOG(TVX_ERR,
          "TVXHBA_FCTagService_Provider::GetConfigTable: '%s' leads out of the folder of the table",
          tvxWithoutPassword(uri.value.c_str()).c_str());
  return false;
}

std::uint32_t getTable(ProviderAgent& agent, const TVXHBA_FCPort& port,
                       const Property<String>& uri) {
  if (!isUsableName(uri)) return NO_TARGET_OR_URI;
  const std::string deviceID = cutText(port.DeviceID, NAME_LENGTH);
  TVX_LOG(TVX_DBG, "TVXHBA_FCTagService_Provider::Successfully got DeviceID,%s", deviceID.c_str());
  takeDumpPath(agent, deviceID);
  const Tag_Adapter adapter(agent, port,
                            "TVXHBA_FCTagService_Provider::Failed to Open Adapter, Skipping "
                            "GetConfigTable Adaptor Name:");
  if (adapter.result != METHOD_OK) return adapter.result;
  TVX_LOG(TVX_DBG, "TVXHBA_FCTagService_Provider::Successfully Opened Adapter, hbaHandle:%d",
          static_cast<int>(adapter.handle));
  TVX_QoSTable table;
  if (const std::uint32_t result = fetchTable(adapter.handle, table); result != METHOD_OK)
    return result;
  PrintQoSEntry(table);
  TVX_LOG(TVX_DBG, "TVXHBA_FCTagService_Provider::GetConfigTable");
  if (!tryToWriteTable(table, uri.value.c_str(), deviceID)) return LIBRARY_FAILED;
  TVX_LOG(TVX_DBG, "TVXHBA_FCTagService_Provider::GetConfigTable Successful");
  return METHOD_OK;
}

// --- From a file into the library ----------------------------------------------------------------

/// METHOD_OK if there is such a file, or the result of the method.
std::uint32_t checkFile(const char* path) {
  struct stat info = {};
  if (::stat(path, &info) == 0) return METHOD_OK;
  if (errno == ENOENT) {
    TVX_LOG(TVX_ERR, "ERROR:TVXHBA_FCTagService_Provider::Configuration file not found");
    return FILE_NOT_FOUND;
  }
  TVX_LOG(TVX_ERR, "ERROR: TVXHBA_FCTagService_Provider:: Can't stat Configuration file ");
  return CANNOT_STAT;
}

/// Reads the document and sets its table. `result` stays as it was if that does not come about.
void setFromFile(const char* path, HBA_HANDLE handle, Property<std::uint32_t>& result) {
  TVX_LOG(TVX_DBG, "TVXHBA_FCTagService_Provider::Entering SetConfigTable");
  std::string text = readWholeFile(path);
  const TVX_QoSTable table = readConfigTable(text);
  if (!table) return;
  PrintQoSEntry(table);
  if (const int error = CPQFC_QoSSetConfig(handle, table.get()); error != 0) {
    TVX_LOG(TVX_ERR, "TVXHBA_FCTagService_Provider::CPQFC_QoSSetConfig failed with an error :%d",
            error);
    result.set(LIBRARY_FAILED);
    return;
  }
  TVX_LOG(TVX_ERR, "TVXHBA_FCTagService_Provider::CPQFC_QoSSetConfig is success");
  result.set(METHOD_OK);
}

/// `setFromFile`, with its exceptions logged.
void tryToSetFromFile(const char* path, HBA_HANDLE handle, Property<std::uint32_t>& result) {
  try {
    setFromFile(path, handle, result);
  } catch (const std::bad_alloc&) {
    TVX_LOG(TVX_DBG, "SetConfigTable: Memory allocation failed");
  } catch (const std::exception& exception) {
    TVX_LOG(TVX_DBG, "%s", exception.what());
  } catch (...) {
    TVX_LOG(TVX_DBG, "unknown exectiion is caught");
  }
}

void removeFetched(const char* path) {
  struct stat info = {};
  if (::stat(path, &info) != 0) {
    TVX_LOG(TVX_DBG, "TVXHBA_FCTagService_Provider:: Can't stat file %s",
            tvxWithoutPassword(path).c_str());
    return;
  }
  if (std::remove(path) == 0)
    TVX_LOG(TVX_DBG, "TVXHBA_FCTagService_Provider::: FC TAG Config file %s removed successfully",
            tvxWithoutPassword(path).c_str());
}

void setTable(ProviderAgent& agent, const TVXHBA_FCPort& port, const Property<String>& uri,
              Property<std::uint32_t>& result) {
  if (uri.is_null() || uri.value.empty()) {
    TVX_LOG(TVX_ERR, "TVXHBA_FCTagService_Provider::Null sized URI");
    result.set(NO_TARGET_OR_URI);
    return;
  }
  bool fetched = false;
  const String path = TVX_MethodWrapper::downloadFileUsingCurl(uri.value, result, fetched);
  TVX_LOG(TVX_DBG, "TVXHBA_FCTagService_Provider::filename is : %s",
          tvxWithoutPassword(path.c_str()).c_str());
  if (const std::uint32_t refused = checkFile(path.c_str()); refused != METHOD_OK) {
    result.set(refused);
    return;
  }
  const Tag_Adapter adapter(agent, port,
                            "TVXHBA_FCTagService_Provider::Failed to Open Adapter, Skipping "
                            "SetConfigTable Adapter Name:");
  if (adapter.result != METHOD_OK) {
    result.set(adapter.result);
    return;
  }
  tryToSetFromFile(path.c_str(), adapter.handle, result);
  if (fetched) removeFetched(path.c_str());
}

}  // namespace

std::int32_t TVXHBA_FCTagService_Provider::GetGlobalFlag(const TVXHBA_FCTagService* service,
                                                         const TVXHBA_FCPort* target,
                                                         Property<std::uint32_t>& state,
                                                         Property<std::uint32_t>& return_value) {
  Service_Call call;
  const TVXHBA_FCPort* port = nullptr;
  return_value.set(openCall(call.agent, service, target, port));
  if (port) return_value.set(getFlag(call.agent, *port, state));
  return INVOKE_METHOD_OK;
}

std::int32_t TVXHBA_FCTagService_Provider::SetGlobalFlag(const TVXHBA_FCTagService* service,
                                                         const TVXHBA_FCPort* target,
                                                         const Property<std::uint32_t>& state,
                                                         Property<std::uint32_t>& return_value) {
  Service_Call call;
  const TVXHBA_FCPort* port = nullptr;
  return_value.set(openCall(call.agent, service, target, port));
  if (port) return_value.set(setFlag(call.agent, *port, state.value));
  return INVOKE_METHOD_OK;
}

std::int32_t TVXHBA_FCTagService_Provider::GetConfigTable(const TVXHBA_FCTagService* service,
                                                          const TVXHBA_FCPort* target,
                                                          const Property<String>& uri,
                                                          Property<std::uint32_t>& return_value) {
  Service_Call call;
  const TVXHBA_FCPort* port = nullptr;
  return_value.set(openCall(call.agent, service, target, port));
  if (port) return_value.set(getTable(call.agent, *port, uri));
  return INVOKE_METHOD_OK;
}

std::int32_t TVXHBA_FCTagService_Provider::SetConfigTable(const TVXHBA_FCTagService* service,
                                                          const TVXHBA_FCPort* target,
                                                          const Property<String>& uri,
                                                          Property<std::uint32_t>& return_value) {
  Service_Call call;
  const TVXHBA_FCPort* port = nullptr;
  return_value.set(openCall(call.agent, service, target, port));
  if (port) setTable(call.agent, *port, uri, return_value);
  return INVOKE_METHOD_OK;
}

}  // namespace cimrt
