#include "runtime/Value.h"

#include <cstring>
#include <new>

#include "runtime/Key_Features.h"
#include "runtime/Log.h"

namespace cimrt {
namespace {

using Instances = Array<Instance*>;

struct Type_Names {
  Type type;
  const char* upper;
  const char* lower;
};

constexpr Type_Names type_names[] = {
    {NONE, "NONE", "none"},
    {BOOLEAN, "BOOLEAN", "boolean"},
    {UINT8, "UINT8", "uint8"},
    {SINT8, "SINT8", "sint8"},
    {UINT16, "UINT16", "uint16"},
    {SINT16, "SINT16", "sint16"},
    {UINT32, "UINT32", "uint32"},
    {SINT32, "SINT32", "sint32"},
    {UINT64, "UINT64", "uint64"},
    {SINT64, "SINT64", "sint64"},
    {REAL32, "REAL32", "real32"},
    {REAL64, "REAL64", "real64"},
    {CHAR16, "CHAR16", "char16"},
    {STRING, "STRING", "string"},
    {DATETIME, "DATETIME", "datetime"},
    {INSTANCE, "INSTANCE", "instance"},
    {BOOLEAN_ARRAY, "BOOLEAN_ARRAY", "boolean_array"},
    {UINT8_ARRAY, "UINT8_ARRAY", "uint8_array"},
    {SINT8_ARRAY, "SINT8_ARRAY", "sint8_array"},
    {UINT16_ARRAY, "UINT16_ARRAY", "uint16_array"},
    {SINT16_ARRAY, "SINT16_ARRAY", "sint16_array"},
    {UINT32_ARRAY, "UINT32_ARRAY", "uint32_array"},
    {SINT32_ARRAY, "SINT32_ARRAY", "sint32_array"},
    {UINT64_ARRAY, "UINT64_ARRAY", "uint64_array"},
    {SINT64_ARRAY, "SINT64_ARRAY", "sint64_array"},
    {REAL32_ARRAY, "REAL32_ARRAY", "real32_array"},
    {REAL64_ARRAY, "REAL64_ARRAY", "real64_array"},
    {CHAR16_ARRAY, "CHAR16_ARRAY", "char16_array"},
    {STRING_ARRAY, "STRING_ARRAY", "string_array"},
    {DATETIME_ARRAY, "DATETIME_ARRAY", "datetime_array"},
    {INSTANCE_ARRAY, "INSTANCE_ARRAY", "instance_array"},
};

const Type_Names& names_of(Type type) {
  for (const Type_Names& names : type_names)
    if (names.type == type) return names;
  return type_names[0];
}

bool is_array(Type type) {
  return type >= BOOLEAN_ARRAY && type <= INSTANCE_ARRAY;
}

Type scalar_of(Type type) {
  return is_array(type) ? static_cast<Type>(type & ~ARRAY_BIT) : type;
}

/// A plain scalar lies in the union itself; everything else is one object of pointer width.
bool is_plain_scalar(Type type) {
  return type >= BOOLEAN && type <= CHAR16;
}

void ref_each(const Instances& instances) {
  for (Instance* instance : instances) ref(instance);
}

void unref_each(const Instances& instances) {
  for (Instance* instance : instances) unref(instance);
}

template <class T>
T& as(void* p) {
  return *std::launder(static_cast<T*>(p));
}

template <class T>
const T& as(const void* p) {
  return *std::launder(static_cast<const T*>(p));
}

const char* class_name(const Instance* instance) {
  return instance->meta_class->name;
}

bool may_refer(const Instance* instance, const Meta_Feature* feature, const Instance* target) {
  const Meta_Reference* mr = as_reference(feature);
  if (!target || is_subclass(mr->meta_class, class_of(target))) return true;
  CIMRT_TRACE(LOG_WARN_, "failed to assign instance of %s to %s.%s", class_name(target),
              class_name(instance), feature->name);
  return false;
}

/// Stores a target in a field that holds none yet.
int store_target(Instance* instance, const Meta_Feature* feature, Instance* target) {
  if (!may_refer(instance, feature, target)) return -1;
  ref(target);
  target_of(instance, feature) = target;
  return 0;
}

/// Stores targets in a field that holds none yet. A target of a wrong class ends the list: the
/// field keeps the targets in front of it.
int store_targets(Instance* instance, const Meta_Feature* feature, const Instances& targets) {
  Instances& field = targets_of(instance, feature);
  field = targets;
  for (std::size_t i = 0; i < field.size(); ++i) {
    if (!may_refer(instance, feature, field[i])) {
      field.remove(i, field.size() - i);
      return -1;
    }
    ref(field[i]);
  }
  return 0;
}

}  // namespace

const char* type_name(Type type) {
  return names_of(type).upper;
}

const char* type_name_lower(Type type) {
  return names_of(type).lower;
}

Type feature_type(const Meta_Feature* feature) {
  if (is_reference(feature)) return as_reference(feature)->subscript ? INSTANCE_ARRAY : INSTANCE;
  if (!is_property(feature)) return NONE;
  const Meta_Property* mp = as_property(feature);
  return static_cast<Type>(mp->subscript ? mp->type | ARRAY_BIT : mp->type);
}

Value::Value(const Value& other) {
  hold(other);
}

Value& Value::operator=(const Value& other) {
  if (this == &other) return *this;
  clear();
  hold(other);
  return *this;
}

Value::~Value() {
  clear();
}

void Value::hold(const Value& other) {
  construct(other._type, &other._value);
  _null = other._null;
  if (_type == INSTANCE) ref(as<Instance*>(&_value));
  if (_type == INSTANCE_ARRAY) ref_each(as<Instances>(&_value));
}

/// Makes the empty union hold a copy of the object at `from`, taking no instance references.
void Value::construct(Type type, const void* from) {
  if (is_plain_scalar(type)) {
    std::memcpy(&_value, from, type_size_table[type]);
  } else if (type == STRING) {
    ::new (&_value) String(as<String>(from));
  } else if (type == DATETIME) {
    ::new (&_value) Datetime(as<Datetime>(from));
  } else if (type == INSTANCE) {
    ::new (&_value) Instance*(as<Instance*>(from));
  } else if (is_array(type)) {
    ::new (&_value) Array_Base(as<Array_Base>(from));
  }
  _type = type;
}

void Value::clear() {
  if (_type == STRING) {
    as<String>(&_value).~String();
  } else if (_type == DATETIME) {
    as<Datetime>(&_value).~Datetime();
  } else if (_type == INSTANCE) {
    unref(as<Instance*>(&_value));
  } else if (is_array(_type)) {
    if (_type == INSTANCE_ARRAY) unref_each(as<Instances>(&_value));
    as<Array_Base>(&_value).~Array_Base();
  }
  _value.uint64 = 0;
  _type = NONE;
  _null = 1;
}

void Value::take(Type type, const void* from) {
  // What is handed in may be part of what is released: copied first.
  Value copy;
  copy.construct(type, from);
  clear();
  std::memcpy(static_cast<void*>(&_value), static_cast<const void*>(&copy._value), sizeof _value);
  _type = type;
  _null = 0;
  copy._type = NONE;
}

int Value::get_char16(char16_t& x) const {
  if (_type != CHAR16) return -1;
  // Only the low byte survives, with its sign: the data are ASCII.
  x = static_cast<char16_t>(static_cast<std::int16_t>(static_cast<std::int8_t>(_value.char16)));
  return 0;
}

const void* Value::held(Type type) const {
  return _type == type ? &_value : nullptr;
}

int Value::set(Instance* instance, const Meta_Feature* feature) const {
  if (!instance) {
    CIMRT_TRACE(LOG_WARN_, "null instance argument");
    return -1;
  }
  if (feature_type(feature) != _type) {
    CIMRT_TRACE(LOG_WARN_, "type mismatch: %s.%s", class_name(instance), feature->name);
    return -1;
  }
  if (_type == NONE) return -1;
  if (is_property(feature)) *null_flag(instance, feature) = _null;
  if (_type == INSTANCE) return store_target(instance, feature, as<Instance*>(&_value));
  if (_type == INSTANCE_ARRAY) return store_targets(instance, feature, as<Instances>(&_value));

  void* to = storage(instance, feature);
  if (is_plain_scalar(_type)) {
    std::memcpy(to, &_value, type_size_table[_type]);
  } else if (_type == STRING) {
    as<String>(to) = as<String>(&_value);
  } else if (_type == DATETIME) {
    as<Datetime>(to) = as<Datetime>(&_value);
  } else {
    as<Array_Base>(to) = as<Array_Base>(&_value);
  }
  return 0;
}

int Value::get(const Instance* instance, const Meta_Feature* feature) {
  clear();
  const Type type = feature_type(feature);
  if (type == NONE) return -1;
  construct(type, storage(instance, feature));
  _null = is_null(instance, feature) ? 1 : 0;
  if (_type == INSTANCE) ref(as<Instance*>(&_value));
  if (_type == INSTANCE_ARRAY) ref_each(as<Instances>(&_value));
  return 0;
}

void Value::print(std::FILE* stream) const {
  std::fputs("Value\n{\n", stream);
  std::fprintf(stream, "    type=%s\n    null=%s\n", type_name(_type), null() ? "true" : "false");
  if (!null()) print_held(stream);
  std::fputs("}\n", stream);
}

void Value::print_held(std::FILE* stream) const {
  std::fputs("    value=", stream);
  if (_type == INSTANCE_ARRAY) {
    std::fputs("\n    {\n", stream);
    for (const Instance* instance : as<Instances>(&_value))
      if (instance) cimrt::print(stream, instance);
    std::fputs("    }\n", stream);
  } else if (_type == INSTANCE) {
    std::fputs("\n", stream);
    if (const Instance* instance = as<Instance*>(&_value)) cimrt::print(stream, instance);
  } else {
    if (is_array(_type)) {
      write_array(stream, scalar_of(_type), as<Array_Base>(&_value));
    } else if (_type != NONE) {
      write_scalar(stream, _type, &_value);
    }
    std::fputs("\n", stream);
  }
}

}  // namespace cimrt
