// Life of the wrapper, its checks and the library's own facts.
#include "access/TVX_MethodWrapper.h"

#include <fcntl.h>
#include <semaphore.h>
#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <cerrno>
#include <cstdio>
#include <cstring>
#include <exception>

#include "access/TVX_AttributeReader.h"
#include "common/CLogger.h"
#include "common/TVX_Memory.h"
#include "runtime/Lasting.h"
#include "runtime/Thread_Context.h"
#include "runtime/Threads.h"

namespace cimrt {

// ---- Initialisation of the library, one caller at a time ----

namespace {

constexpr mode_t SEMAPHORE_MODE = 0644;
constexpr unsigned INIT_VALUE = 2;

/// State of the process: it outlives each wrapper.
struct Init_State {
  Mutex mutex;  // guards the names and the opening of the first semaphore
  unsigned long processId = 0;
  std::string initName;
  std::string doneName;
  std::atomic<sem_t*> initSemaphore{nullptr};
  std::atomic<sem_t*> doneSemaphore{nullptr};  // stays open: it is never posted nor closed
  std::atomic<int> firstComer{0};
};

Init_State& state() {
  static Lasting<Init_State> instance;
  return *instance;
}

sem_t* openSemaphore(const std::string& name, unsigned value) {
  sem_t* const semaphore = ::sem_open(name.c_str(), O_CREAT, SEMAPHORE_MODE, value);
  return semaphore != SEM_FAILED ? semaphore : nullptr;
}

void waitFor(sem_t* semaphore) {
  while (::sem_wait(semaphore) != 0 && errno == EINTR) {
  }
}

void nameSemaphores(Init_State& s) {
  s.processId = static_cast<unsigned long>(::getpid());
  s.initName = "/TVX_RM_INIT_LIB_" + std::to_string(s.processId);
  s.doneName = "/TVX_RM_INIT_LIB_DONE_" + std::to_string(s.processId);
}

/// Opens the first semaphore; one that a dead process with this id left behind goes first.
sem_t* openInitSemaphore(Init_State& s) {
  const Auto_Mutex lock(s.mutex);
  nameSemaphores(s);
  if (s.initSemaphore.load() == nullptr) ::sem_unlink(s.initName.c_str());
  sem_t* const semaphore = openSemaphore(s.initName, INIT_VALUE);
  s.initSemaphore.store(semaphore);
  return semaphore;
}

void dropInitSemaphore(Init_State& s, sem_t* semaphore) {
  const Auto_Mutex lock(s.mutex);
  ::sem_close(semaphore);
  ::sem_unlink(s.initName.c_str());
  sem_t* expected = semaphore;
  s.initSemaphore.compare_exchange_strong(expected, nullptr);
}

void runInitLib(Init_State& s, sem_t* semaphore) {
  const RM_STATUS status = LRM_InitLib();
  if (status > 0) {
    TVX_LOG(TVX_CRIT, "Error : Initialization of RMLib:: RM_InitLib failed with[%d]", status);
    ::sem_post(semaphore);
    dropInitSemaphore(s, semaphore);
    throw std::exception();
  }
  TVX_LOG(TVX_DBG, "Signalling Completed Semaphore.. Running RM_InitLib");
  ::sem_post(semaphore);
  TVX_LOG(TVX_DBG, "Signaled Completed Semaphore.. Running RM_InitLib");
}

void initialiseAsFirst(Init_State& s, sem_t* semaphore) {
  TVX_LOG(TVX_DBG, "Aquired Semaphore.. Running RM_InitLib %s ", s.initName.c_str());
  s.firstComer = 1;
  s.doneSemaphore.store(openSemaphore(s.doneName, 0));
  TVX_LOG(TVX_DBG, "Aquired Completed Semaphore.. Running RM_InitLib %s", s.doneName.c_str());
  runInitLib(s, semaphore);
}

void waitForFirst(Init_State& s, sem_t* semaphore) {
  TVX_LOG(TVX_DBG, "Waiting on Completed Semaphore.. To issue RM Calls..%s.. sem = %p",
          s.initName.c_str(), static_cast<void*>(semaphore));
  waitFor(semaphore);
  TVX_LOG(TVX_DBG, "Recieved signal on Completed Semaphore.. To issue RM Calls");
}

}  // namespace

TVX_MethodWrapper::TVX_MethodWrapper() {
  TVX_LOG(TVX_DBG, "TVX_MethodWrapper::Constructor");
  TVX_LOG(TVX_DBG, "Setting Up for FIFO.. ");
  Init_State& s = state();
  if (sem_t* const semaphore = openInitSemaphore(s)) {
    int value = 0;
    ::sem_getvalue(semaphore, &value);
    waitFor(semaphore);
    if (value == static_cast<int>(INIT_VALUE)) {
      initialiseAsFirst(s, semaphore);
    } else {
      waitForFirst(s, semaphore);
    }
  }
  TVX_LOG(TVX_DBG, "RM Library initialized");
}

TVX_MethodWrapper::~TVX_MethodWrapper() {
  TVX_LOG(TVX_DBG, "TVX_MethodWrapper::Destructor");
  Init_State& s = state();
  if (sem_t* const semaphore = s.initSemaphore.exchange(nullptr)) {
    ::sem_post(semaphore);
    int value = 0;
    ::sem_getvalue(semaphore, &value);
    TVX_LOG(TVX_DBG, "Value of Sem in destructor=%d", value);
    dropInitSemaphore(s, semaphore);
  }
  TVX_LOG(TVX_DBG, "RM Library uninitialzed");
}

// ---- Checks and status ----

RM_STATUS TVX_MethodWrapper::Validatewwpn(const HBA_WWN* wwpn) {
  TVX_LOG(TVX_DBG, "Entering TVX_MethodWrapper::Validatewwpn()");
  std::uint32_t local = 0;
  const RM_STATUS status = wwpn != nullptr ? RM_IsLocalHBA(*wwpn, &local) : RM_ERROR;
  TVX_LOG(TVX_DBG, "RM_IsLocalHBA: status=%d", status);
  if (status == RM_OK && local != 0) return RM_OK;
  TVX_LOG(TVX_ERR, "HBA IS NOT LOCAL");
  return RM_ERROR;
}

int TVX_MethodWrapper::IsCorvanCNA(const HBA_WWN* wwpn) {
  TVX_LOG(TVX_DBG, "TVX_MethodWrapper::IsCorvanCNA");
  if (Validatewwpn(wwpn) != RM_OK) {
    TVX_LOG(TVX_DBG, "INVALID wwpn");
    return 0;
  }
  std::uint32_t value = 0;
  const RM_STATUS status = LRM_GetHBAFeature(*wwpn, RM_FEATURE_CORVAN_CNA, &value);
  if (status != RM_OK || value != 1) return 0;
  TVX_LOG(TVX_DBG, "Corvan CNA Port ");
  return 1;
}

void TVX_MethodWrapper::StatusString(RM_STATUS status) {
  char text[256] = {};
  RM_StatusString(status, text, sizeof text);
  text[sizeof text - 1] = '\0';
  if (text[0] != '\0') {
    TVX_LOG(TVX_DBG, "Status: <%d>:%s", status, text);
  } else {
    TVX_LOG(TVX_DBG, "Status: <%d>", status);
  }
}

// ---- Facts of the library ----

RM_STATUS TVX_MethodWrapper::GetMILILibVersion(char* version) {
  if (version == nullptr) {
    TVX_LOG(TVX_DBG, "Invalid Output pointer");
    return RM_ERROR_INVALID_POINTER;
  }
  RM_STATUS status = RM_ERROR_VERSION_TOO_SMALL;
  TVX_Block buffer;
  // The second try has the same room, so it does not cure a version that is too long.
  for (int tries = 0; tries < 2 && status == RM_ERROR_VERSION_TOO_SMALL; ++tries) {
    buffer = tvxAllocate(TVX_VERSION_SIZE);
    if (buffer == nullptr) {
      TVX_LOG(TVX_ERR, "Unable to allocate the memory for pMILILibVerBuf");
      return RM_ERROR_NO_MEMORY;
    }
    status = RM_MiliVersion(reinterpret_cast<char*>(buffer.get()), TVX_VERSION_SIZE);
  }
  if (status != RM_OK) {
    TVX_LOG(TVX_DBG, "ERROR: Failed to get MILILibVersion, returned with code %d", status);
    return status;
  }
  std::memcpy(version, buffer.get(), TVX_VERSION_SIZE);
  TVX_LOG(TVX_DBG, "MILILibVersion: %.*s", static_cast<int>(TVX_VERSION_SIZE), version);
  return status;
}

RM_STATUS TVX_MethodWrapper::GetLibraryVersion(int selector, char* version, std::size_t room) {
  if (version == nullptr) {
    TVX_LOG(TVX_DBG, "Invalid Output pointer");
    return RM_ERROR_INVALID_POINTER;
  }
  RM_STATUS status = RM_ERROR_VERSION_TOO_SMALL;
  std::uint32_t size = TVX_VERSION_SIZE;
  std::uint32_t allocated = 0;
  TVX_Block buffer;
  for (int tries = 0; tries < 2 && status == RM_ERROR_VERSION_TOO_SMALL; ++tries) {
    allocated = size;
    buffer = tvxAllocate(allocated);
    if (buffer == nullptr) {
      TVX_LOG(TVX_ERR, "Unable to allocate the memory for pLibVerBuf");
      return RM_ERROR_NO_MEMORY;
    }
    status = RM_GetVersion(selector, reinterpret_cast<char*>(buffer.get()), &size);
  }
  if (status != RM_OK) {
    TVX_LOG(TVX_DBG, "ERROR: Failed to get MILILibVersion, returned with code %d", status);
    return status;
  }
  const std::size_t copied = std::min({std::size_t{size}, std::size_t{allocated}, room});
  std::memcpy(version, buffer.get(), copied);
  TVX_LOG(TVX_DBG, "MILILibVersion: %.*s", static_cast<int>(copied), version);
  return status;
}

RM_STATUS TVX_MethodWrapper::SetMILITraceLevel(int level, int target) {
  return LRM_SetDebugTraces(level, target);
}

RM_STATUS TVX_MethodWrapper::GetHBAFeatureList(const HBA_WWN* wwpn, std::uint8_t* features) {
  if (features == nullptr || wwpn == nullptr) {
    TVX_LOG(TVX_DBG, "Invalid output pointer");
    return RM_ERROR_INVALID_POINTER;
  }
  const RM_STATUS status = LRM_GetHBAFeatureList(*wwpn, RM_FEATURE_LIST_SIZE, features);
  if (status != RM_OK) {
    StatusString(status);
    TVX_LOG(TVX_DBG, "Failed to get the HBA List, exited with the error code %d", status);
  }
  for (int offset = 0; offset < RM_FEATURE_LIST_SIZE; offset += 32) {
    TVX_LOG(TVX_DBG, "TVX_MethodWrapper::Features: %d->%u", offset, features[offset]);
  }
  return status;
}

RM_STATUS TVX_MethodWrapper::GetQosInfo(const HBA_WWN* wwpn, void* info) {
  if (info == nullptr || wwpn == nullptr) return RM_ERROR_INVALID_POINTER;
  return LRM_GetQoS(*wwpn, info);
}

// ---- A target's operating system ----

namespace {

RM_STATUS readOsInfo(const void* block, char* osInfo) {
  const TVX_Attribute attribute = findAttribute(block, RM_SA_OS_INFO);
  if (attribute.status != RM_OK) {
    TVX_LOG(TVX_ERR,
            "ERROR: TVX_MethodWrapper::getTargetOS_info:Unable to retrieve attribute value");
    return RM_ERROR;
  }
  const std::uint8_t* const attr = attribute.value;
  // The message is the condition's own text.
  // cppcheck-suppress incorrectStringBooleanError
  CIMRT_ASSERT("NULL check on " && attr);
  std::strncpy(osInfo, attributeText(attribute).c_str(), TVX_OS_INFO_SIZE);
  return RM_OK;
}

}  // namespace

RM_STATUS TVX_MethodWrapper::getTargetOS_info(const char* name, char* osInfo) {
  if (name == nullptr) {
    TVX_LOG(TVX_ERR, "Invalid macAddr passed");
    return RM_ERROR;
  }
  if (osInfo == nullptr) return RM_ERROR_INVALID_POINTER;
  HBA_WWN wwn{};
  if (const RM_STATUS status = deviceIdToWWN(&wwn, name); status != RM_OK) return status;
  const TVX_Block block = allocateAttributeBlock(RM_SERVER_ATTRIBUTES_SIZE);
  if (block == nullptr) {
    TVX_LOG(TVX_ERR, "ERROR: TVX_MethodWrapper::getTargetOS_info: Unable to allocate buffer");
    return RM_ERROR_NO_MEMORY;
  }
  std::uint32_t size = RM_SERVER_ATTRIBUTES_SIZE;
  if (const RM_STATUS status = LRM_GetServerAttributes(wwn, block.get(), &size); status != RM_OK) {
    TVX_LOG(TVX_ERR, "RM_GetServerAttributes failed with %d", status);
    return status;
  }
  return readOsInfo(block.get(), osInfo);
}

// ---- List of distinct names ----

void TVX_MethodWrapper::freeWWPNList(HBA_WWN*** list, int* count) {
  for (int i = 0; i < *count; ++i) std::free((*list)[i]);
  std::free(*list);
  *list = nullptr;
  *count = 0;
}

namespace {

bool isListed(const HBA_WWN& wwn, HBA_WWN* const* list, int count) {
  return std::any_of(list, list + count, [&](const HBA_WWN* known) {
    return std::memcmp(known, &wwn, sizeof wwn) == 0;
  });
}

/// Makes room for one more pointer. False, with the list as it was, without memory.
bool growList(HBA_WWN**& list, int count) {
  const auto used = static_cast<std::size_t>(count);
  TVX_Block grown = tvxAllocate((used + 1) * sizeof(HBA_WWN*));
  if (grown == nullptr) return false;
  if (used != 0) std::memcpy(grown.get(), list, used * sizeof(HBA_WWN*));
  std::free(list);
  list = reinterpret_cast<HBA_WWN**>(grown.release());
  return true;
}

int dropList(HBA_WWN*** list, int* count, const char* what) {
  std::printf("\nERROR: isDuplicateEntryInWWPNList: %s failed", what);
  TVX_MethodWrapper::freeWWPNList(list, count);
  return 0;
}

}  // namespace

int TVX_MethodWrapper::isDuplicateEntryInWWPNList(const HBA_WWN* wwn, HBA_WWN*** list, int* count) {
  if (*count > 0 && isListed(*wwn, *list, *count)) return 1;
  if (!growList(*list, *count)) return dropList(list, count, "realloc");
  TVX_Block copy = tvxAllocate(sizeof *wwn);
  if (copy == nullptr) return dropList(list, count, "malloc");
  std::memcpy(copy.get(), wwn, sizeof *wwn);
  (*list)[*count] = reinterpret_cast<HBA_WWN*>(copy.release());
  ++*count;
  return 0;
}

}  // namespace cimrt
