#include "cmpi/CMPI_Containers.h"

#include <cstdlib>
#include <cstring>

#include "cmpi/CMPI_Object.h"
#include "cmpi/CMPI_Plain_Types.h"
#include "cmpi/CMPI_Value.h"
#include "runtime/Log.h"

namespace cimrt {

namespace {

/// A name that a server answered, or -1 if there is none.
int take_name(const CMPIString* text, String& name) {
  const char* chars = text ? CMGetCharsPtr(text, nullptr) : nullptr;
  if (!chars) return -1;
  name.assign(chars);
  return 0;
}

/// The servers' setters do not change the handle, but take it as one that may be.
template <class T>
T* writable(const T* object) {
  return const_cast<T*>(object);
}

bool is_integer(Type type) {
  return type >= UINT8 && type <= SINT64;
}

/// Cuts a 64-bit integer to the width of `type`; the null flag stays.
void narrow(std::uint64_t bits, Type type, Value& value) {
  const bool null = value.null();
  with_plain_type(type, [&](auto plain) {
    value.set(static_cast<typename decltype(plain)::type>(bits));
    return 0;
  });
  value.set_null_flag(null);
}

void narrow_key(Type type, Value& value) {
  if (!is_integer(type) || type == value.type()) return;
  std::uint64_t as_unsigned = 0;
  std::int64_t as_signed = 0;
  if (value.get(as_unsigned) == 0)
    narrow(as_unsigned, type, value);
  else if (value.get(as_signed) == 0)
    narrow(static_cast<std::uint64_t>(as_signed), type, value);
}

bool parse_boolean(const char* text, CMPIValue& value) {
  if (strncasecmp(text, "true", 4) == 0)
    value.boolean = 1;
  else if (strncasecmp(text, "false", 5) == 0)
    value.boolean = 0;
  else
    return false;
  return true;
}

/// Reads `text` as a scalar of `type`. False, with `value` as it was, if that cannot be done.
bool parse_scalar(const char* text, Type type, CMPIValue& value) {
  switch (type) {
    case NONE:
      CIMRT_TRACE(LOG_WARN_, "missing type");
      return false;
    case BOOLEAN:
      return parse_boolean(text, value);
    case UINT8:
    case SINT8:
    case UINT16:
    case SINT16:
    case UINT32:
    case SINT32:
      return with_plain_type(type, [&](auto plain) {
               using Kind = decltype(plain);
               Kind::write(value, static_cast<typename Kind::type>(std::strtol(text, nullptr, 10)));
               return 0;
             }) == 0;
    default:
      CIMRT_TRACE(LOG_WARN_, "Default case - unsupported type");
      return false;
  }
}

/// Turns a text argument into one of the type that the parameter has; what cannot be read so goes
/// on as the text that it is. The text object stays with the arguments that hold it.
void cast_cmpi_string_to_scalar(Type type, CMPIData& data) {
  if (type > REAL64) {
    CIMRT_TRACE(LOG_INFO_, "cast_cmpi_string_to_scalar(): Not supported");
    return;
  }
  if (!data.value.string) {
    CIMRT_TRACE(LOG_WARN_, "ignored null CMPI string");
    return;
  }
  const char* text = CMGetCharsPtr(data.value.string, nullptr);
  if (!text) {
    CIMRT_TRACE(LOG_WARN_, "CMGetCharsPtr() failed");
    return;
  }
  if (!parse_scalar(text, type, data.value)) return;
  data.type = cmpi_type_of(type, 0);
  CIMRT_TRACE(LOG_WARN_, "converting string to registered parameter type");
}

}  // namespace

bool CMPI_Container::in_bounds(std::uint32_t index) {
  if (index < get_size()) return true;
  CIMRT_TRACE(LOG_WARN_, "bounds error");
  return false;
}

int CMPI_Container::to_value(const CMPIData& data, Value& value) const {
  return cmpi_to_cimrt_value(meta_repository(), _broker, _name_space, data, value);
}

int CMPI_Container::to_data(const char* name, const Value& value, std::uint32_t flags,
                            CMPIData& data) const {
  if (_to_cmpi_data(meta_repository(), _broker, _name_space, value, flags, data) == 0) return 0;
  CIMRT_TRACE(LOG_WARN_, "_to_cmpi_data() failed: feature=%s", name);
  return -1;
}

int CMPI_Container::check_type(const char* name, Type type, const Value& value) {
  if (value.type() == type) return 0;
  CIMRT_TRACE(LOG_WARN_, "type mismatch on %s: %s/%s", name, type_name_lower(value.type()),
              type_name_lower(type));
  return -1;
}

// ---- Instances

CMPIInstance_Container::CMPIInstance_Container(const Meta_Repository* meta_repository,
                                               const CMPIBroker* broker, const char* name_space,
                                               const CMPIInstance* instance)
    : CMPI_Container(meta_repository, broker, name_space), _instance(instance) {}

std::uint32_t CMPIInstance_Container::get_size() {
  return CMGetPropertyCount(_instance, nullptr);
}

int CMPIInstance_Container::get_name(std::uint32_t index, String& name) {
  if (!in_bounds(index)) return -1;
  CMPIString* text = nullptr;
  CMPIStatus status = {CMPI_RC_OK, nullptr};
  CMGetPropertyAt(_instance, index, &text, &status);
  if (status.rc != CMPI_RC_OK) {
    CIMRT_TRACE(LOG_WARN_, "CMGetPropertyAt() failed");
    return -1;
  }
  return take_name(text, name);
}

int CMPIInstance_Container::get_value(std::uint32_t index, Type type, Value& value) {
  if (!in_bounds(index)) return -1;
  CMPIString* text = nullptr;
  CMPIStatus status = {CMPI_RC_OK, nullptr};
  const CMPIData data = CMGetPropertyAt(_instance, index, &text, &status);
  if (status.rc != CMPI_RC_OK) {
    CIMRT_TRACE(LOG_WARN_, "CMGetPropertyAt() failed");
    return -1;
  }
  if (to_value(data, value) != 0) return -1;
  return check_type(text_of(text), type, value);
}

int CMPIInstance_Container::set_value(const char* name, const Value& value, std::uint32_t flags) {
  CMPIData data;
  if (to_data(name, value, flags, data) != 0) return -1;
  const CMPIStatus status = CMSetProperty(writable(_instance), name, &data.value, data.type);
  release_scalar(data);
  if (status.rc == CMPI_RC_OK) return 0;
  CIMRT_TRACE(LOG_WARN_, "CMSetProperty() failed: %s", name);
  return -1;
}

// ---- Object paths

CMPIObjectPath_Container::CMPIObjectPath_Container(const Meta_Repository* meta_repository,
                                                   const CMPIBroker* broker, const char* name_space,
                                                   const CMPIObjectPath* path)
    : CMPI_Container(meta_repository, broker, name_space), _path(path) {}

std::uint32_t CMPIObjectPath_Container::get_size() {
  return CMGetKeyCount(_path, nullptr);
}

int CMPIObjectPath_Container::get_name(std::uint32_t index, String& name) {
  if (!in_bounds(index)) return -1;
  CMPIString* text = nullptr;
  CMGetKeyAt(_path, index, &text, nullptr);
  return take_name(text, name);
}

int CMPIObjectPath_Container::get_value(std::uint32_t index, Type type, Value& value) {
  if (!in_bounds(index)) return -1;
  CMPIString* text = nullptr;
  CMPIStatus status = {CMPI_RC_OK, nullptr};
  const CMPIData data = CMGetKeyAt(_path, index, &text, &status);
  if (status.rc != CMPI_RC_OK || to_value(data, value) != 0) return -1;
  narrow_key(type, value);
  return check_type(text_of(text), type, value);
}

int CMPIObjectPath_Container::set_value(const char* name, const Value& value, std::uint32_t flags) {
  CMPIData data;
  if (to_data(name, value, flags, data) != 0) return -1;
  const CMPIStatus status = CMAddKey(writable(_path), name, &data.value, data.type);
  release_scalar(data);
  if (status.rc == CMPI_RC_OK) return 0;
  CIMRT_TRACE(LOG_WARN_, "CMAddKey() failed");
  return -1;
}

// ---- Arguments

CMPIArgs_Container::CMPIArgs_Container(const Meta_Repository* meta_repository,
                                       const CMPIBroker* broker, const char* name_space,
                                       const CMPIArgs* args)
    : CMPI_Container(meta_repository, broker, name_space), _args(args), _return_value{} {}

std::uint32_t CMPIArgs_Container::get_size() {
  return _args ? CMGetArgCount(_args, nullptr) : 0;
}

int CMPIArgs_Container::get_name(std::uint32_t index, String& name) {
  if (!in_bounds(index)) return -1;
  CMPIString* text = nullptr;
  CMGetArgAt(_args, index, &text, nullptr);
  return take_name(text, name);
}

int CMPIArgs_Container::get_value(std::uint32_t index, Type type, Value& value) {
  if (!in_bounds(index)) return -1;
  CMPIString* text = nullptr;
  CMPIStatus status = {CMPI_RC_OK, nullptr};
  CMPIData data = CMGetArgAt(_args, index, &text, &status);
  if (status.rc != CMPI_RC_OK) return -1;
  if ((data.state & CMPI_nullValue) == 0 && data.type == CMPI_string && type != STRING)
    cast_cmpi_string_to_scalar(type, data);
  if (to_value(data, value) != 0) {
    CIMRT_TRACE(LOG_WARN_, "cmpi_to_cimrt_value() failed");
    return -1;
  }
  // An absent array of references reaches us from some servers as a boolean.
  if (value.type() == BOOLEAN && type == INSTANCE_ARRAY) {
    value.set(Array<Instance*>());
    value.set_null_flag(true);
  }
  return check_type(text_of(text), type, value);
}

int CMPIArgs_Container::set_value(const char* name, const Value& value, std::uint32_t flags) {
  CMPIData data;
  if (to_data(name, value, flags, data) != 0) return -1;
  if (std::strcmp(name, "return_value") == 0) {
    _return_value = data;
    return 0;
  }
  if (!_args) return -1;
  const CMPIStatus status = CMAddArg(writable(_args), name, &data.value, data.type);
  release_scalar(data);
  if (status.rc == CMPI_RC_OK) return 0;
  CIMRT_TRACE(LOG_WARN_, "CMAddArg() failed");
  return -1;
}

}  // namespace cimrt
