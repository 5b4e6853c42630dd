// Between CMPI data and plain values.
#pragma once

#include <optional>

#include "broker/Objects.h"

namespace tvx::host {

/// Copies what a provider passes as value and type. CMPI_chars takes `value` itself as the text,
/// CMPI_charsptr its member `chars`; both become strings. A null pointer becomes a typed null.
/// Nothing if the type is unknown or an object is not what the type says.
std::optional<Value> fromCmpi(const CMPIValue* value, CMPIType type);

/// The same for one CMPIData.
std::optional<Value> fromCmpi(const CMPIData& data);

/// Makes CMPI data; objects in it are new and belong to the calling thread's request.
CMPIData toCmpi(Core& core, const Value& value);

/// What a get function answers for something that is not there.
CMPIData notFoundData(CMPIStatus* rc, CMPIrc code);

/// Named value by index, with its name as a new string; `missing` is the code for a bad index.
CMPIData valueAt(Core& core, const NamedValues& values, CMPICount index, CMPIString** name,
                 CMPIStatus* rc, CMPIrc missing);

/// Named value by name.
CMPIData valueNamed(Core& core, const NamedValues& values, const char* name, CMPIStatus* rc,
                    CMPIrc missing);

}  // namespace tvx::host
