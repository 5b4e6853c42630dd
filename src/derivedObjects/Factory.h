// What the exported factories call.
#pragma once

#include <cstddef>

#include "cmpi/cmpidt.h"
#include "cmpi/cmpift.h"
#include "derivedObjects/Skeleton_Provider.h"

/// Marks what the shared library exports.
#define TVX_EXPORT [[gnu::visibility("default")]]

namespace cimrt {

/// The management interface of the class at `index` of `provider_entries`, made on first need and
/// shared by all callers; it stays valid until its clean-up. Never null.
/// @param letter 'I' CMPIInstanceMI, 'M' CMPIMethodMI, 'A' CMPIAssociationMI
void* make_interface(std::size_t index, const CMPIBroker* broker, const CMPIContext* context,
                     char letter) noexcept;

}  // namespace cimrt

/// Head of the list of registrations: the last of `provider_entries`.
extern "C" TVX_EXPORT const cimrt::Registration* cimrt_module() noexcept;
