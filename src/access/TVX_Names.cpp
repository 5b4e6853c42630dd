// Text forms of port names.
#include <cctype>
#include <cstdio>
#include <cstring>
#include <string>

#include "access/TVX_MethodWrapper.h"
#include "common/CLogger.h"
#include "common/TVX_Common.h"

namespace cimrt {

namespace {

constexpr std::size_t WWN_DIGITS = 16;

bool isHex(char c) {
  return std::isxdigit(static_cast<unsigned char>(c)) != 0;
}

bool isSeparatorPlace(std::size_t index) {
  return index % 3 == 2;
}

/// 23 characters: pairs of digits with a colon or a blank between.
bool hasNameLayout(const char* text) {
  if (text == nullptr || std::strlen(text) != TVX_HBA_NAME_LENGTH) return false;
  for (std::size_t i = 0; i < TVX_HBA_NAME_LENGTH; ++i) {
    const char c = text[i];
    if (isSeparatorPlace(i) ? c != ':' && c != ' ' : !isHex(c)) return false;
  }
  return true;
}

bool readByte(const char* text, std::uint8_t& byte) {
  unsigned value = 0;
  if (std::sscanf(text, "%02x", &value) != 1) return false;
  byte = static_cast<std::uint8_t>(value);
  return true;
}

bool readTokens(const char* hbaName, HBA_WWN& wwn) {
  std::string copy = hbaName;
  char* rest = nullptr;
  char* from = copy.data();
  for (HBA_UINT8& byte : wwn.wwn) {
    const char* token = tvxStrtok(from, ": ", &rest);
    from = nullptr;
    if (token == nullptr || !readByte(token, byte)) return false;
  }
  return true;
}

}  // namespace

RM_STATUS TVX_MethodWrapper::Id2HBAName(char* hbaName, const char* deviceId) {
  if (hbaName == nullptr || deviceId == nullptr) {
    TVX_LOG(TVX_ERR, "Null pointer argument in one of the arguments");
    return RM_ERROR;
  }
  const char* source = deviceId[0] == '"' ? deviceId + 1 : deviceId;
  for (std::size_t i = 0; i < TVX_HBA_NAME_LENGTH; ++i) {
    if (isSeparatorPlace(i)) {
      hbaName[i] = ':';
      continue;
    }
    // An id that ends early ends the name: nothing behind its NUL is read.
    hbaName[i] = *source;
    if (*source == '\0') break;
    ++source;
  }
  hbaName[TVX_HBA_NAME_LENGTH] = '\0';
  TVX_LOG(TVX_DBG, "DeviceID is:: %s", deviceId);
  TVX_LOG(TVX_DBG, "HBA Name is:: %s", hbaName);
  return RM_OK;
}

RM_STATUS TVX_MethodWrapper::str2HBAName(HBA_WWN* wwn, const char* hbaName) {
  if (wwn == nullptr || !hasNameLayout(hbaName) || !readTokens(hbaName, *wwn)) {
    TVX_LOG(TVX_ERR, "INVALID HBA Name");
    return RM_ERROR;
  }
  const HBA_UINT8* b = wwn->wwn;
  TVX_LOG(TVX_DBG, "After tokenizing wwpn:( %2x %2x %2x %2x %2x %2x %2x %2x )", b[0], b[1], b[2],
          b[3], b[4], b[5], b[6], b[7]);
  return RM_OK;
}

int TVX_MethodWrapper::string2HBAName(HBA_WWN* wwn, const char* text) {
  const std::size_t length = text != nullptr ? std::strlen(text) : 1;
  bool valid = wwn != nullptr && (length == 0 || length == WWN_DIGITS);
  for (std::size_t i = 0; valid && i < WWN_DIGITS; i += 2) {
    valid = isHex(text[i]) && isHex(text[i + 1]) && readByte(text + i, wwn->wwn[i / 2]);
  }
  if (valid) return 1;
  TVX_LOG(TVX_ERR, "INVALID WWN");
  return 0;
}

RM_STATUS TVX_MethodWrapper::HBAName2str(char* hbaName, const HBA_WWN& wwn) {
  if (hbaName == nullptr) return RM_OK;
  const HBA_UINT8* b = wwn.wwn;
  std::snprintf(hbaName, TVX_HBA_NAME_LENGTH + 1, "%02X:%02X:%02X:%02X:%02X:%02X:%02X:%02X", b[0],
                b[1], b[2], b[3], b[4], b[5], b[6], b[7]);
  return RM_OK;
}

RM_STATUS TVX_MethodWrapper::deviceIdToWWN(HBA_WWN* wwn, const char* deviceId) {
  char hbaName[TVX_HBA_NAME_LENGTH + 1] = {};
  if (Id2HBAName(hbaName, deviceId) != RM_OK) {
    TVX_LOG(TVX_ERR, "Id2HBAName failed");
    return RM_ERROR;
  }
  if (str2HBAName(wwn, hbaName) != RM_OK) {
    TVX_LOG(TVX_ERR, "str2HBAName failed");
    return RM_ERROR;
  }
  return RM_OK;
}

}  // namespace cimrt
