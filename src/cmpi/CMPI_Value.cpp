#include "cmpi/CMPI_Value.h"

#include <new>

#include "cmpi/CMPI_Containers.h"
#include "cmpi/CMPI_Object.h"
#include "cmpi/CMPI_Plain_Types.h"
#include "runtime/Log.h"

namespace cimrt {

namespace {

struct Type_Row {
  Type type;
  CMPIType cmpi_type;
};

/// Scalar codes; an array has the array bit of its side added. The first row of a type is the code
/// that is written.
constexpr Type_Row type_rows[] = {
    {BOOLEAN, CMPI_boolean},   {UINT8, CMPI_uint8},       {SINT8, CMPI_sint8},
    {UINT16, CMPI_uint16},     {SINT16, CMPI_sint16},     {UINT32, CMPI_uint32},
    {SINT32, CMPI_sint32},     {UINT64, CMPI_uint64},     {SINT64, CMPI_sint64},
    {REAL32, CMPI_real32},     {REAL64, CMPI_real64},     {CHAR16, CMPI_char16},
    {STRING, CMPI_string},     {DATETIME, CMPI_dateTime}, {INSTANCE, CMPI_ref},
    {INSTANCE, CMPI_instance},
};

/// Where a conversion takes place: what nested instances need beside the value itself.
struct Place {
  const Meta_Repository* repository;
  const CMPIBroker* broker;
  const char* name_space;
};

template <class T>
void set_empty(bool array, Value& value) {
  if (array)
    value.set(Array<T>());
  else
    value.set(T());
}

void set_null(Type type, Value& value) {
  const bool array = is_array(type);
  const Type scalar = scalar_of(type);
  if (scalar == STRING)
    set_empty<String>(array, value);
  else if (scalar == DATETIME)
    set_empty<Datetime>(array, value);
  else if (scalar == INSTANCE && array)
    value.set(Array<Instance*>());
  else if (scalar == INSTANCE)
    value.set(static_cast<Instance*>(nullptr));
  else
    with_plain_type(scalar, [&](auto plain) {
      set_empty<typename decltype(plain)::type>(array, value);
      return 0;
    });
  value.set_null_flag(true);
}

/// Missing text objects and missing characters count as the empty text.
String read_string(const CMPIString* text) {
  if (!text) {
    CIMRT_TRACE(LOG_WARN_, "ignored null CMPI string");
    return String();
  }
  const char* chars = CMGetCharsPtr(text, nullptr);
  if (!chars) CIMRT_TRACE(LOG_WARN_, "CMGetCharsPtr() failed");
  return String(chars);
}

int read_datetime(const CMPIDateTime* datetime, Datetime& out) {
  CMPIStatus status = {CMPI_RC_OK, nullptr};
  const CMPIString* text = datetime ? CMGetStringFormat(datetime, &status) : nullptr;
  const char* chars = text && status.rc == CMPI_RC_OK ? CMGetCharsPtr(text, nullptr) : nullptr;
  if (!chars) {
    CIMRT_TRACE(LOG_WARN_, "CMGetStringFormat() failed");
    return -1;
  }
  if (!out.set(chars)) {
    CIMRT_TRACE(LOG_WARN_, "conversion error");
    return -1;
  }
  return 0;
}

/// Class of the object behind a path; null (logged) if the repository does not know it.
const Meta_Class* class_at(const Place& place, const CMPIObjectPath* path) {
  CMPIStatus status = {CMPI_RC_OK, nullptr};
  const CMPIString* text = CMGetClassName(path, &status);
  const char* name = text && status.rc == CMPI_RC_OK ? CMGetCharsPtr(text, nullptr) : nullptr;
  if (!name) {
    CIMRT_TRACE(LOG_WARN_, "CMGetClassName() failed");
    return nullptr;
  }
  const Meta_Class* found = place.repository ? find_meta_class(place.repository, name) : nullptr;
  if (!found) CIMRT_TRACE(LOG_WARN_, "failed to find meta class: %s", name);
  return found;
}

/// Without memory for the nested instance the whole request fails, not this value alone: a provider
/// must not take it for one that the client left out.
int convert_all(Container& container, const Meta_Class* meta_class, Instance*& out) {
  try {
    if (container.convert(meta_class, 0, out) == 0 && out) return 0;
  } catch (const std::bad_alloc&) {
    CIMRT_TRACE(LOG_WARN_, "failed to create CIMRT instance");
    throw;
  }
  CIMRT_TRACE(LOG_WARN_, "failed to create CIMRT instance");
  return -1;
}

int read_embedded(const Place& place, CMPIInstance* embedded, Instance*& out) {
  if (!embedded) return 0;
  CMPIStatus status = {CMPI_RC_OK, nullptr};
  const CMPIObjectPath* path = CMGetObjectPath(embedded, &status);
  if (!path || status.rc != CMPI_RC_OK) {
    CIMRT_TRACE(LOG_WARN_, "CMGetObjectPath() failed");
    return -1;
  }
  const Meta_Class* meta_class = class_at(place, path);
  if (!meta_class) return -1;
  CMPIInstance_Container container(place.repository, place.broker, place.name_space, embedded);
  return convert_all(container, meta_class, out);
}

int read_reference(const Place& place, CMPIObjectPath* path, Instance*& out) {
  if (!path) {
    CIMRT_TRACE(LOG_WARN_, "null instance");
    return 0;
  }
  const Meta_Class* meta_class = class_at(place, path);
  if (!meta_class) return -1;
  CMPIObjectPath_Container container(place.repository, place.broker, place.name_space, path);
  return convert_all(container, meta_class, out);
}

/// An embedded instance or a reference; a null pointer gives a null instance.
int read_instance(const Place& place, const CMPIData& data, Instance*& out) {
  out = nullptr;
  return data.type == CMPI_instance ? read_embedded(place, data.value.inst, out)
                                    : read_reference(place, data.value.ref, out);
}

int read_scalar(const Place& place, Type type, const CMPIData& data, Value& value) {
  switch (type) {
    case STRING:
      value.set(read_string(data.value.string));
      return 0;
    case DATETIME: {
      Datetime datetime;
      if (read_datetime(data.value.dateTime, datetime) != 0) return -1;
      value.set(datetime);
      return 0;
    }
    case INSTANCE: {
      Instance* instance = nullptr;
      if (read_instance(place, data, instance) != 0) return -1;
      value.set(instance);
      return 0;
    }
    default:
      return with_plain_type(type, [&](auto plain) {
        value.set(decltype(plain)::read(data.value));
        return 0;
      });
  }
}

/// Reads each element with `read(element, place of the result)`; the first failure ends it.
template <class T, class Read>
int read_elements(const CMPIArray* source, CMPIType element_type, Array<T>& target, Read&& read) {
  const CMPICount count = CMGetArrayCount(source, nullptr);
  target.resize(count, T());
  for (CMPICount i = 0; i < count; ++i) {
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    const CMPIData element = CMGetArrayElementAt(source, i, &status);
    if (element.type != element_type) {
      CIMRT_TRACE(LOG_WARN_, "type mismatch");
      return -1;
    }
    if ((element.state & CMPI_nullValue) != 0) {
      CIMRT_TRACE(LOG_WARN_, "encountered null array element");
      return -1;
    }
    if (status.rc != CMPI_RC_OK || read(element, target[i]) != 0) return -1;
  }
  return 0;
}

/// Instances under construction, released unless they are handed over.
class Instance_List {
 public:
  Instance_List() = default;
  ~Instance_List() {
    for (Instance* instance : _items) unref(instance);
  }
  Instance_List(const Instance_List&) = delete;
  Instance_List& operator=(const Instance_List&) = delete;

  void resize(std::size_t n) { _items.resize(n, nullptr); }
  Instance*& operator[](std::size_t i) { return _items[i]; }
  void hand_over(Value& value) {
    value.set(_items);
    _items.clear();
  }

 private:
  Array<Instance*> _items;
};

/// One element of an array of instances: here a null element is kept.
int read_instance_element(const Place& place, const CMPIData& element, CMPIType element_type,
                          Instance*& out) {
  if (element.type != element_type) {
    CIMRT_TRACE(LOG_WARN_, "array element type mismatch");
    return -1;
  }
  if ((element.state & CMPI_nullValue) != 0) return 0;
  if (!element.value.inst) {
    CIMRT_TRACE(LOG_WARN_, "encountered null instance element");
    return -1;
  }
  return read_instance(place, element, out);
}

int read_instance_array(const Place& place, const CMPIArray* source, CMPIType element_type,
                        Value& value) {
  Instance_List list;
  const CMPICount count = CMGetArrayCount(source, nullptr);
  list.resize(count);
  for (CMPICount i = 0; i < count; ++i) {
    const CMPIData element = CMGetArrayElementAt(source, i, nullptr);
    if (read_instance_element(place, element, element_type, list[i]) != 0) return -1;
  }
  list.hand_over(value);
  return 0;
}

template <class T, class Read>
int read_array_of(const CMPIArray* source, CMPIType element_type, Value& value, Read&& read) {
  Array<T> array;
  if (read_elements(source, element_type, array, read) != 0) return -1;
  value.set(array);
  return 0;
}

int read_array(const Place& place, Type scalar, const CMPIData& data, Value& value) {
  const CMPIArray* source = data.value.array;
  if (!source) return -1;
  const auto element_type = static_cast<CMPIType>(data.type & ~CMPI_ARRAY);
  switch (scalar) {
    case STRING:
      return read_array_of<String>(source, element_type, value, [](const CMPIData& e, String& out) {
        out = read_string(e.value.string);
        return 0;
      });
    case DATETIME:
      return read_array_of<Datetime>(
          source, element_type, value,
          [](const CMPIData& e, Datetime& out) { return read_datetime(e.value.dateTime, out); });
    case INSTANCE:
      return read_instance_array(place, source, element_type, value);
    default:
      return with_plain_type(scalar, [&](auto plain) {
        using Kind = decltype(plain);
        using T = typename Kind::type;
        return read_array_of<T>(source, element_type, value, [](const CMPIData& e, T& out) {
          out = Kind::read(e.value);
          return 0;
        });
      });
  }
}

}  // namespace

Type type_of_cmpi(CMPIType cmpi_type) {
  const auto element = static_cast<CMPIType>(cmpi_type & ~CMPI_ARRAY);
  for (const Type_Row& row : type_rows) {
    if (row.cmpi_type != element) continue;
    return element == cmpi_type ? row.type : static_cast<Type>(row.type | ARRAY_BIT);
  }
  return NONE;
}

CMPIType cmpi_type_of(Type type, std::uint32_t flags) {
  const Type scalar = scalar_of(type);
  const CMPIType array_bit = is_array(type) ? CMPI_ARRAY : CMPI_null;
  if (scalar == INSTANCE && (flags & (FLAG_EMBEDDED_INSTANCE | FLAG_EMBEDDED_OBJECT)) != 0)
    return static_cast<CMPIType>(CMPI_instance | array_bit);
  for (const Type_Row& row : type_rows)
    if (row.type == scalar) return static_cast<CMPIType>(row.cmpi_type | array_bit);
  return CMPI_null;
}

int cmpi_to_cimrt_value(const Meta_Repository* repository, const CMPIBroker* broker,
                        const char* name_space, const CMPIData& data, Value& value) {
  const Type type = type_of_cmpi(data.type);
  if (type == NONE) {
    CIMRT_TRACE(LOG_WARN_, "unknown type");
    return -1;
  }
  if ((data.state & CMPI_nullValue) != 0) {
    set_null(type, value);
    return 0;
  }
  // A value that the server marks as absent or broken has no contents to look at.
  if ((data.state & (CMPI_notFound | CMPI_badValue)) != 0) return -1;

  const Place place = {repository, broker, name_space};
  return is_array(type) ? read_array(place, scalar_of(type), data, value)
                        : read_scalar(place, type, data, value);
}

}  // namespace cimrt
