// Reads single attributes out of the opaque blocks of the management library.
#pragma once

#include <cstdint>
#include <string>

#include "common/TVX_Memory.h"
#include "rmapi/rmapi.h"

namespace cimrt {

/// A zeroed attribute block for a library that is told `size`: a value that claims to reach over
/// the block's end can still be read by the readers below. Null when memory ran out.
TVX_Block allocateAttributeBlock(std::uint32_t size);

/// Where the value of one attribute lies in its block, as the library told.
struct TVX_Attribute {
  const std::uint8_t* value = nullptr;  ///< null if the attribute could not be read
  std::uint32_t length = 0;             ///< bytes, as the library claims
  RM_STATUS status = RM_ERROR;          ///< 0 if it could
};

/// Looks an attribute up. A library without a reader counts as a failed read.
TVX_Attribute findAttribute(const void* block, std::uint32_t key);

/// Gives the first four bytes as a number in host order; shorter values are widened. False, with
/// `value` as it was, if the attribute could not be read or has no bytes.
bool attributeNumber(const TVX_Attribute& attribute, std::uint32_t& value);

/// Gives the text up to its NUL, its length or 255 bytes; empty if the attribute could not be read.
std::string attributeText(const TVX_Attribute& attribute);

/// Shared readers of adapter attributes: they log value or failure at `TVX_DBG` under the label and
/// answer whether the attribute could be read.
bool readNumberAttribute(const void* block, std::uint32_t key, const char* label,
                         std::uint32_t& value);  ///< keeps `value` on failure
bool readTextAttribute(const void* block, std::uint32_t key, const char* label,
                       std::string& value);  ///< empties `value` on failure

}  // namespace cimrt
