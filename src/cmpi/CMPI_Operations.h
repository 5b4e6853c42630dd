// Entries of the function tables, by table.
#pragma once

#include "cmpi/CMPI_Adapter.h"

namespace cimrt {

/// Fill the entries of one table; the head is left alone.
void fill_instance_table(CMPIInstanceMIFT& table);
void fill_method_table(CMPIMethodMIFT& table);
void fill_indication_table(CMPIIndicationMIFT& table);
void fill_association_table(CMPIAssociationMIFT& table);

/// Clean-up of any function table of a class: takes one off `load_count`; the last one unloads and
/// destroys the provider, once no request of the class is running. CMPI_RC_DO_NOT_UNLOAD, with
/// nothing changed, if the provider forbids it and the server is not terminating.
CMPIStatus cleanup(CMPI_Static_Data* static_data, const CMPIContext* context,
                   CMPIBoolean terminating) noexcept;

/// Delivers an indication instance (which it takes over) into every namespace with an active
/// filter; called by providers that were enabled, on a thread with a context. False, the end, for a
/// null instance.
bool _indication_proc(Instance* instance, std::int32_t status, void* adapter);

// What the operations share:

/// The class of a path among the classes of the adapter's repository; null if it is none of them.
const Meta_Class* find_class_of_path(const CMPI_Adapter& adapter, const CMPIObjectPath* path);

/// The adapter's own class, as its provider answers it.
const Meta_Class* own_class(const CMPI_Adapter& adapter);

}  // namespace cimrt
