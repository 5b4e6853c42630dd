// The simulator as a vendor library under the SNIA common library: it hands its entry points over
// in a table, and exports nothing else that the common library has too.

// The published headers lack an include of their own; the first one here has to come first.
// clang-format off
#include <ctime>
#include <hbaapi.h>
#include <vendorhbaapi.h>
// clang-format on

namespace {

// The entry points that both generations of the table have.
template <class Table>
void fill_common(Table& table) {
  table.GetVersionHandler = HBA_GetVersion;
  table.LoadLibraryHandler = HBA_LoadLibrary;
  table.FreeLibraryHandler = HBA_FreeLibrary;
  table.GetNumberOfAdaptersHandler = HBA_GetNumberOfAdapters;
  table.GetAdapterNameHandler = HBA_GetAdapterName;
  table.OpenAdapterHandler = HBA_OpenAdapter;
  table.CloseAdapterHandler = HBA_CloseAdapter;
  table.GetAdapterAttributesHandler = HBA_GetAdapterAttributes;
  table.GetAdapterPortAttributesHandler = HBA_GetAdapterPortAttributes;
  table.RefreshInformationHandler = HBA_RefreshInformation;
  table.GetFcpTargetMappingHandler = HBA_GetFcpTargetMapping;
  table.ScsiInquiryHandler = HBA_SendScsiInquiry;
  table.ReadCapacityHandler = HBA_SendReadCapacity;
}

}  // namespace

extern "C" {

HBA_STATUS HBA_RegisterLibrary(HBA_ENTRYPOINTS* table) {
  if (table == nullptr) return HBA_STATUS_ERROR_ARG;
  *table = HBA_ENTRYPOINTS{};
  fill_common(*table);
  return HBA_STATUS_OK;
}

HBA_STATUS HBA_RegisterLibraryV2(HBA_ENTRYPOINTSV2* table) {
  if (table == nullptr) return HBA_STATUS_ERROR_ARG;
  *table = HBA_ENTRYPOINTSV2{};
  fill_common(*table);
  table->RegisterForAdapterPortEventsHandler = HBA_RegisterForAdapterPortEvents;
  table->RemoveCallbackHandler = HBA_RemoveCallback;
  return HBA_STATUS_OK;
}

}  // extern "C"
