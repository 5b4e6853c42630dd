// Provider status codes to CMPI return codes, and the names of the latter.
#pragma once

#include <cstdint>

#include "cmpi/cmpidt.h"

namespace cimrt {

/// First number of the ten status codes of each operation.
enum class Status_Family : std::int32_t {
  GET_INSTANCE = 60,
  ENUM_INSTANCES = 70,
  CREATE_INSTANCE = 80,
  DELETE_INSTANCE = 90,
  MODIFY_INSTANCE = 100,
  ENUM_ASSOCIATOR_NAMES = 110,
  ENUM_REFERENCES = 120,
  INVOKE_METHOD = 130,
  ENABLE_INDICATIONS = 140,
  DISABLE_INDICATIONS = 150,
  ENUM_ASSOCIATORS = 170,
};

/// The code of a status of this family; a number that the family does not have counts as success.
CMPIrc code_of_status(Status_Family family, std::int32_t status);

/// "CMPI_RC_OK" and so on; any unlisted code is "CMPI_RC_ERR_FAILED".
const char* name_of_code(CMPIrc code);

}  // namespace cimrt
