// Names of CIM types and of CMPI return codes.
#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "cmpi/cmpidt.h"

namespace tvx::host {

/// MOF name of a type code ("uint16", "string[]", "ref", "instance"); "null" for 0 and
/// "type 0x%x" for a code that CIM does not know.
std::string typeName(CMPIType type);

/// Scalar type code of a MOF name, in any case; nothing if the name is unknown.
std::optional<CMPIType> typeOfName(std::string_view name);

/// Symbol of a return code, "CMPI_RC_ERR_NOT_FOUND"; "CMPI_RC(n)" for others.
std::string rcName(int rc);

/// The return code in words for a person: "not found", "access denied"; "code n" for others.
std::string rcWords(int rc);

}  // namespace tvx::host
