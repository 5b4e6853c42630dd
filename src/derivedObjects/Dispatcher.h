// The entries of the classes: one operation code and its arguments to one call of the provider.
#pragma once

#include "derivedObjects/Skeleton_Provider.h"

namespace cimrt {

/// The three shapes of an entry. Each takes a registration that is a `Provider_Entry`, and answers
/// the status of the operation, or -1 for an operation that the shape does not have: methods for
/// `plain_proc` and `association_proc`, association operations for `plain_proc` and `method_proc`,
/// indications and unknown codes for all. -1 also answers a call whose first argument, the provider
/// object or the place of a result, is null; only destroying no provider is fine.
///
/// An enumerating operation makes one last call of the handler, with a null instance and the
/// status, after the provider has returned; an association operation that the provider does not
/// support answers so without that call.
///
/// May be called from any thread; calls for one provider object must not overlap.
std::int32_t plain_proc(const Registration* registration, std::uint32_t operation, void* arg0,
                        void* arg1, void* arg2, void* arg3, void* arg4, void* arg5, void* arg6,
                        void* arg7);
std::int32_t method_proc(const Registration* registration, std::uint32_t operation, void* arg0,
                         void* arg1, void* arg2, void* arg3, void* arg4, void* arg5, void* arg6,
                         void* arg7);
std::int32_t association_proc(const Registration* registration, std::uint32_t operation, void* arg0,
                              void* arg1, void* arg2, void* arg3, void* arg4, void* arg5,
                              void* arg6, void* arg7);

}  // namespace cimrt
