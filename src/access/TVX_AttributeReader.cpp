#include "access/TVX_AttributeReader.h"

#include <algorithm>
#include <cstring>

#include "access/TVX_Runtime_Loader.h"
#include "common/CLogger.h"

namespace cimrt {

namespace {

constexpr std::size_t MAX_TEXT = 255;  // no reader takes more than this of one value

}  // namespace

TVX_Block allocateAttributeBlock(std::uint32_t size) {
  return tvxAllocate(std::size_t{size} + MAX_TEXT + 1);
}

TVX_Attribute findAttribute(const void* block, std::uint32_t key) {
  TVX_Attribute attribute;
  const void* value = RM_GetAttributeValue(block, key, &attribute.length, &attribute.status);
  if (attribute.status == RM_OK) attribute.value = static_cast<const std::uint8_t*>(value);
  if (attribute.value == nullptr) attribute.length = 0;
  return attribute;
}

bool attributeNumber(const TVX_Attribute& attribute, std::uint32_t& value) {
  if (attribute.value == nullptr || attribute.length == 0) return false;
  std::uint32_t number = 0;
  std::memcpy(&number, attribute.value, std::min<std::size_t>(attribute.length, sizeof number));
  value = number;
  return true;
}

std::string attributeText(const TVX_Attribute& attribute) {
  if (attribute.value == nullptr) return {};
  const auto* text = reinterpret_cast<const char*>(attribute.value);
  return {text, ::strnlen(text, std::min<std::size_t>(attribute.length, MAX_TEXT))};
}

bool readNumberAttribute(const void* block, std::uint32_t key, const char* label,
                         std::uint32_t& value) {
  const TVX_Attribute attribute = findAttribute(block, key);
  if (!attributeNumber(attribute, value)) {
    TVX_LOG(TVX_DBG, "ERROR: RM_GetHBAAttributeValue HA_%s call failed (%d)", label,
            attribute.status);
    return false;
  }
  TVX_LOG(TVX_DBG, "%s: [ %d ]", label, static_cast<int>(value));
  return true;
}

bool readTextAttribute(const void* block, std::uint32_t key, const char* label,
                       std::string& value) {
  const TVX_Attribute attribute = findAttribute(block, key);
  value = attributeText(attribute);
  if (attribute.value == nullptr) {
    TVX_LOG(TVX_DBG, "ERROR: %s: RM_GetHBAAttributes call failed (%d)", label, attribute.status);
    return false;
  }
  TVX_LOG(TVX_DBG, "%s : [ %s ]", label, value.c_str());
  return true;
}

}  // namespace cimrt
