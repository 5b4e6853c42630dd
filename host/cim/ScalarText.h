// Single values as people and clients write them.
#pragma once

#include <optional>
#include <string>

#include "cim/Value.h"

namespace tvx::host {

/// Reads the text of one value of a scalar type other than references and embedded instances:
/// whole numbers in decimal or 0x form within the type's range, reals, true, false, 1 or 0,
/// datetimes, a character or its number, any text for strings. Nothing if the text does not fit.
std::optional<Value> scalarFromText(CMPIType type, const std::string& text);

/// What fits such a type, for messages: "a number from 0 to 255", "true or false".
std::string fittingText(CMPIType type);

}  // namespace tvx::host
