// Runtime values to CMPI values.
#include <cstring>
#include <type_traits>

#include "cmpi/CMPI_Containers.h"
#include "cmpi/CMPI_Object.h"
#include "cmpi/CMPI_Plain_Types.h"
#include "cmpi/CMPI_Value.h"
#include "runtime/Log.h"

namespace cimrt {

namespace {

struct Place {
  const Meta_Repository* repository;
  const CMPIBroker* broker;
  const char* name_space;
};

int write_string(const Place& place, const String& text, CMPIValue& out) {
  out.string = CMNewString(place.broker, text.c_str(), nullptr);
  return out.string ? 0 : -1;
}

int write_datetime(const Place& place, const Datetime& datetime, CMPIValue& out) {
  char text[Datetime::ASCII_SIZE];
  datetime.ascii(text, false);
  out.dateTime = CMNewDateTimeFromChars(place.broker, text, nullptr);
  return out.dateTime ? 0 : -1;
}

/// The object path of a nested instance, with its keys.
CMPIObjectPath* nested_path(const Place& place, const Instance* instance) {
  const char* own = instance->__name_space.c_str();
  const char* name_space = *own ? own : place.name_space;
  if (!name_space || !*name_space) {
    CIMRT_TRACE(LOG_WARN_, "null namespace");
    return nullptr;
  }
  const char* class_name = instance->meta_class->name;
  if (!class_name || !*class_name) {
    CIMRT_TRACE(LOG_WARN_, "null classname");
    return nullptr;
  }
  CMPIStatus status = {CMPI_RC_OK, nullptr};
  CMPIObjectPath* path = CMNewObjectPath(place.broker, name_space, class_name, &status);
  if (!path || status.rc != CMPI_RC_OK) {
    CIMRT_TRACE(LOG_WARN_, "CMNewObjectPath() failed");
    return nullptr;
  }
  CMPIObjectPath_Container keys(place.repository, place.broker, name_space, path);
  if (keys.convert(instance, FLAG_KEY) != 0) {
    CIMRT_TRACE(LOG_WARN_, "Container::convert() failed");
    CMRelease(path);
    return nullptr;
  }
  return path;
}

int write_embedded(const Place& place, const Instance* instance, CMPIObjectPath* path,
                   CMPIValue& out) {
  CMPIStatus status = {CMPI_RC_OK, nullptr};
  CMPIInstance* embedded = CMNewInstance(place.broker, path, &status);
  if (!embedded || status.rc != CMPI_RC_OK) {
    CIMRT_TRACE(LOG_WARN_, "CMNewInstance() failed");
    return -1;
  }
  CMPIInstance_Container container(place.repository, place.broker, place.name_space, embedded);
  if (container.convert(instance, 0) != 0) {
    CIMRT_TRACE(LOG_WARN_, "Container::convert() failed");
    CMRelease(embedded);
    return -1;
  }
  out.inst = embedded;
  return 0;
}

/// An instance as CMPI_ref (its path alone) or CMPI_instance (the whole).
int write_instance(const Place& place, const Instance* instance, CMPIType type, CMPIValue& out) {
  if (!instance) {
    CIMRT_TRACE(LOG_WARN_, "null instance argument");
    return -1;
  }
  CMPI_Ptr<CMPIObjectPath> path(nested_path(place, instance));
  if (!path) return -1;
  if (type == CMPI_ref) {
    out.ref = path.release();
    return 0;
  }
  if (type == CMPI_instance) return write_embedded(place, instance, path.get(), out);
  CIMRT_TRACE(LOG_WARN_, "unexpected type");
  return -1;
}

int write_scalar(const Place& place, const Value& value, CMPIData& data) {
  switch (value.type()) {
    case STRING: {
      String text;
      return value.get(text) == 0 ? write_string(place, text, data.value) : -1;
    }
    case DATETIME: {
      Datetime datetime;
      return value.get(datetime) == 0 ? write_datetime(place, datetime, data.value) : -1;
    }
    case INSTANCE: {
      Instance* instance = nullptr;
      return value.get(instance) == 0 ? write_instance(place, instance, data.type, data.value) : -1;
    }
    default:
      return with_plain_type(value.type(), [&](auto plain) {
        typename decltype(plain)::type x{};
        if (value.get(x) != 0) return -1;
        decltype(plain)::write(data.value, x);
        return 0;
      });
  }
}

constexpr const char* NOT_TAKEN = "CMSetArrayElementAt() failed";

/// Makes a CMPI array and fills it with `write(element, place of the CMPI value)`.
template <class T, class Write>
int write_array_of(const Place& place, const Value& value, CMPIData& data, Write&& write) {
  constexpr bool is_instance = std::is_same_v<T, Instance*>;
  Array<T> array;
  if (value.get(array) != 0) return -1;
  const auto element_type = static_cast<CMPIType>(data.type & ~CMPI_ARRAY);
  const auto count = static_cast<CMPICount>(array.size());
  CMPIArray* target = CMNewArray(place.broker, count, element_type, nullptr);
  if (!target) return -1;
  for (CMPICount i = 0; i < count; ++i) {
    CMPIValue element = {};
    if (write(array[i], element) != 0) {
      // A text that the server does not make counts as an element that it does not take.
      CIMRT_TRACE(LOG_WARN_, "%s", is_instance ? "element conversion failed" : NOT_TAKEN);
      return -1;
    }
    if (CMSetArrayElementAt(target, i, &element, element_type).rc != CMPI_RC_OK) {
      CIMRT_TRACE(LOG_WARN_, "%s", NOT_TAKEN);
      return -1;
    }
  }
  data.value.array = target;
  return 0;
}

int write_array(const Place& place, const Value& value, CMPIData& data) {
  switch (scalar_of(value.type())) {
    case STRING:
      return write_array_of<String>(place, value, data, [&](const String& text, CMPIValue& out) {
        return write_string(place, text, out);
      });
    case DATETIME:
      return write_array_of<Datetime>(place, value, data,
                                      [&](const Datetime& datetime, CMPIValue& out) {
                                        return write_datetime(place, datetime, out);
                                      });
    case INSTANCE: {
      const auto element_type = static_cast<CMPIType>(data.type & ~CMPI_ARRAY);
      return write_array_of<Instance*>(place, value, data,
                                       [&](const Instance* instance, CMPIValue& out) {
                                         return write_instance(place, instance, element_type, out);
                                       });
    }
    default:
      return with_plain_type(scalar_of(value.type()), [&](auto plain) {
        using Kind = decltype(plain);
        return write_array_of<typename Kind::type>(place, value, data,
                                                   [](typename Kind::type x, CMPIValue& out) {
                                                     Kind::write(out, x);
                                                     return 0;
                                                   });
      });
  }
}

}  // namespace

int _to_cmpi_data(const Meta_Repository* repository, const CMPIBroker* broker,
                  const char* name_space, const Value& value, std::uint32_t flags, CMPIData& data) {
  std::memset(&data, 0, sizeof data);
  if (value.type() == NONE) {
    CIMRT_TRACE(LOG_WARN_, "missing type");
    return -1;
  }
  data.type = cmpi_type_of(value.type(), flags);
  if (value.null()) {
    data.state = CMPI_nullValue;
    return 0;
  }
  const Place place = {repository, broker, name_space};
  return is_array(value.type()) ? write_array(place, value, data)
                                : write_scalar(place, value, data);
}

void release_scalar(CMPIData& data) {
  if ((data.state & CMPI_nullValue) != 0) return;
  if (data.type == CMPI_string && data.value.string)
    CMRelease(data.value.string);
  else if (data.type == CMPI_dateTime && data.value.dateTime)
    CMRelease(data.value.dateTime);
  else if (data.type == CMPI_ref && data.value.ref)
    CMRelease(data.value.ref);
  else if (data.type == CMPI_instance && data.value.inst)
    CMRelease(data.value.inst);
}

}  // namespace cimrt
