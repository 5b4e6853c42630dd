// One CMPI value to and from one runtime value.
#pragma once

#include "cmpi/cmpidt.h"
#include "runtime/Value.h"

namespace cimrt {

/// Type of a CMPI type code, arrays included; `NONE` for a code that has none.
Type type_of_cmpi(CMPIType cmpi_type);

/// CMPI code of a type, arrays included; 0 for `NONE`. Instances become CMPI_instance if the
/// feature's `flags` mark them as embedded, CMPI_ref otherwise.
CMPIType cmpi_type_of(Type type, std::uint32_t flags);

/// Converts `data` to `value`. Null data give the empty value of the type, flagged null.
/// @param repository  must know the classes of embedded instances and references
/// @param broker      may be null
/// @return 0, or -1 (logged) with `value` undefined
int cmpi_to_cimrt_value(const Meta_Repository* repository, const CMPIBroker* broker,
                        const char* name_space, const CMPIData& data, Value& value);

/// Converts `value` to `data`, whose objects are the server's and live as long as the request,
/// unless `release_scalar` gives them back.
/// @param name_space  for instances that have none of their own
/// @param flags       those of the feature that the value comes from
/// @return 0, or -1 (logged) with `data` undefined
int _to_cmpi_data(const Meta_Repository* repository, const CMPIBroker* broker,
                  const char* name_space, const Value& value, std::uint32_t flags, CMPIData& data);

/// Gives the object of a scalar back to the server, once it was copied into another object.
void release_scalar(CMPIData& data);

}  // namespace cimrt
