// Association queries answered by enumerating the association's own instances.
#pragma once

#include "cmpi/CMPI_Adapter.h"

namespace cimrt {

/// Restrictions of an associators query; the empty text restricts nothing.
struct Associator_Filter {
  String result_class;
  String role;
  String result_role;
};

/// Delivers the association instances that refer to `source`, in `role` unless that is empty: from
/// the provider if it answers such queries, otherwise out of an enumeration with `model`.
/// @return a status of the references family
std::int32_t default_references(const CMPI_Adapter& adapter, const Instance* source,
                                const Instance* model, const String& role, Instance_Proc handler,
                                void* client_data);

/// Delivers the objects at the far ends of the association instances that refer to `source`.
/// @return a status of the associator names family
std::int32_t default_associators(const CMPI_Adapter& adapter, const Instance* source,
                                 const Associator_Filter& filter, Instance_Proc handler,
                                 void* client_data);

}  // namespace cimrt
