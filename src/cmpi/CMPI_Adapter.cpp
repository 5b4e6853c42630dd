#include "cmpi/CMPI_Adapter.h"

#include <cstring>

#include "cmpi/CMPI_Object.h"
#include "cmpi/CMPI_Operations.h"
#include "cmpi/Operation_Frame.h"

namespace cimrt {

namespace {

constexpr int TABLE_VERSION = 100;

/// Appends what fits, always leaving a terminated text.
void append_text(char (&buffer)[CMPI_NAME_SIZE], const char* text) {
  const std::size_t used = strnlen(buffer, CMPI_NAME_SIZE - 1);
  const std::size_t n = strnlen(text, CMPI_NAME_SIZE - 1 - used);
  std::memcpy(buffer + used, text, n);
  buffer[used + n] = '\0';
}

void build_name(char (&buffer)[CMPI_NAME_SIZE], const char* kind, const char* name) {
  buffer[0] = '\0';
  append_text(buffer, kind);
  append_text(buffer, name);
}

template <class Table>
void fill_head(Table& table) {
  table.ftVersion = TABLE_VERSION;
  table.miVersion = TABLE_VERSION;
  table.miName = nullptr;
}

/// A provider that throws where there is nobody to tell counts as one that answered a failure.
template <class... Args>
void call_and_contain(const CMPI_Adapter& adapter, std::uint32_t operation, Args... args) {
  try {
    adapter.call(operation, args...);
  } catch (...) {
  }
}

}  // namespace

CMPI_Adapter::CMPI_Adapter(const CMPIBroker* server, const CMPIContext* context, const char* name,
                           const Registration* class_registration, CMPI_Static_Data* class_data)
    : registration(class_registration),
      provider_proc(class_registration->provider_proc),
      static_data(class_data) {
  call(OPERATION_CREATE_PROVIDER, &provider);

  CIMRT_TRACE(LOG_DBG_, "enter: %s()", "CMPI_Adapter");
  {
    const Context_Guard pushed(server, context, this);
    fill_static_data(name);
    broker = server;
    load_count = 1;
    // A failed load leaves a living adapter, whose calls are answered from empty data.
    call_and_contain(*this, OPERATION_LOAD, provider);
    call_and_contain(*this, OPERATION_GET_META_CLASS, &meta_class);
    CIMRT_TRACE(LOG_DBG_, "return: %s()", "CMPI_Adapter");
  }
}

void CMPI_Adapter::fill_static_data(const char* name) {
  CMPI_Static_Data& data = *static_data;
  data.magic = CMPI_STATIC_DATA_MAGIC;
  data.adapter = this;

  fill_head(data.instance_mift);
  fill_head(data.method_mift);
  fill_head(data.indication_mift);
  fill_head(data.association_mift);

  build_name(data.instance_name, "instance", name);
  build_name(data.method_name, "method", name);
  build_name(data.indication_name, "indication", name);
  build_name(data.association_name, "association", name);

  fill_instance_table(data.instance_mift);
  fill_method_table(data.method_mift);
  fill_indication_table(data.indication_mift);
  fill_association_table(data.association_mift);

  // All four names go to the instance table, where the last one stays; the other tables carry none.
  // Servers have seen the interfaces named so from the first release on.
  for (const char* table_name :
       {data.instance_name, data.method_name, data.indication_name, data.association_name})
    data.instance_mift.miName = table_name;
}

CMPI_Adapter::~CMPI_Adapter() {
  CIMRT_TRACE(LOG_DBG_, "enter: %s()", "~CMPI_Adapter");
  static_data->magic = CMPI_STATIC_DATA_DEAD;
  static_data->adapter = nullptr;
  CIMRT_TRACE(LOG_DBG_, "return: %s()", "~CMPI_Adapter");
  indication_filters.clear();
  call_and_contain(*this, OPERATION_DESTROY_PROVIDER, provider);
}

// ---- Factories

namespace {

/// With `load_lock` held.
void get_or_create(CMPI_Static_Data* static_data, const Registration* registration,
                   const CMPIBroker* broker, const CMPIContext* context, const char* name) {
  if (static_data->adapter) {
    ++static_data->adapter->load_count;
    return;
  }
  // The constructor enters the adapter into the static data, before the provider's load runs.
  new CMPI_Adapter(broker, context, name, registration, static_data);
}

template <class MI, class Table>
void* hand_out(CMPI_Static_Data* static_data, MI& mi, Table& table) {
  mi.hdl = static_data;
  mi.ft = &table;
  return &mi;
}

void* interface_of(CMPI_Static_Data* data, char letter) {
  switch (letter) {
    case 'I':
      return hand_out(data, data->instance_mi, data->instance_mift);
    case 'M':
      return hand_out(data, data->method_mi, data->method_mift);
    case 'A':
      return hand_out(data, data->association_mi, data->association_mift);
    case 'N':
      return hand_out(data, data->indication_mi, data->indication_mift);
    default:
      return nullptr;
  }
}

}  // namespace

int cimrt_cmpi_adapter(char /*reserved*/, CMPI_Static_Data* static_data,
                       const Registration* registration, const CMPIBroker* broker,
                       const CMPIContext* context, const char* name, char letter,
                       void** result) noexcept {
  try {
    const Load_Guard guard(static_data);
    get_or_create(static_data, registration, broker, context, name);
    CIMRT_TRACE(LOG_DBG_, "enter: %s()", "cimrt_cmpi_adapter");
    if (void* interface = interface_of(static_data, letter)) *result = interface;
    CIMRT_TRACE(LOG_DBG_, "return: %s()", "cimrt_cmpi_adapter");
  } catch (...) {
    // No provider object could be made: the server gets no interface.
  }
  return 0;
}

// ---- Clean-up

namespace {

CMPIrc cleanup_adapter(CMPI_Static_Data* static_data, bool terminating) {
  CMPI_Adapter* adapter = static_data->adapter;
  CIMRT_TRACE(LOG_DBG_, "enter: %s()", "cleanup");
  const bool may_unload = terminating || adapter->allow_unload->load();
  const bool last = adapter->load_count == 1;
  if (!may_unload || (last && Request_Guard::inside(static_data))) {
    CIMRT_TRACE(LOG_DBG_, "cleanup do not unload");
    return CMPI_RC_DO_NOT_UNLOAD;
  }
  if (!last) {
    --adapter->load_count;
    CIMRT_TRACE(LOG_DBG_, "cleanup decrement");
    return CMPI_RC_OK;
  }
  // A server that terminates may still have requests running.
  Request_Guard::wait_until_idle(static_data);
  call_and_contain(*adapter, OPERATION_UNLOAD, adapter->provider);
  CIMRT_TRACE(LOG_DBG_, "cleanup unload");
  delete adapter;
  return CMPI_RC_OK;
}

}  // namespace

CMPIStatus cleanup(CMPI_Static_Data* static_data, const CMPIContext* context,
                   CMPIBoolean terminating) noexcept {
  try {
    const Load_Guard guard(static_data);
    if (!static_data->adapter) return status_of(CMPI_RC_OK);
    const Context_Guard pushed(static_data->adapter->broker, context, static_data->adapter);
    return status_of(cleanup_adapter(static_data, terminating != 0));
  } catch (...) {
    return status_of(CMPI_RC_ERR_FAILED);
  }
}

// ---- What the operations share

const Meta_Class* find_class_of_path(const CMPI_Adapter& adapter, const CMPIObjectPath* path) {
  const Meta_Repository* repository = nullptr;
  adapter.call(OPERATION_GET_REPOSITORY, &repository);
  return repository ? find_meta_class(repository, class_name_of(path)) : nullptr;
}

const Meta_Class* own_class(const CMPI_Adapter& adapter) {
  const Meta_Class* meta_class = nullptr;
  adapter.call(OPERATION_GET_META_CLASS, &meta_class);
  return meta_class;
}

}  // namespace cimrt
