#include "broker/Marshal.h"

namespace tvx::host {
namespace {

std::optional<Value> textOf(const CMPIString* string) {
  const StringObject* object = StringObject::from(string, "a value of type CMPI_string");
  if (object == nullptr) {
    return Value::null(CMPI_string);
  }
  return object->contents.text ? Value::string(*object->contents.text) : Value::stringWithoutText();
}

std::optional<Value> dateTimeOf(const CMPIDateTime* dateTime) {
  const DateTimeObject* object = DateTimeObject::from(dateTime, "a value of type CMPI_dateTime");
  return object == nullptr ? Value::null(CMPI_dateTime) : Value::dateTime(object->contents);
}

std::optional<Value> pathOf(const CMPIObjectPath* path) {
  const PathObject* object = PathObject::from(path, "a value of type CMPI_ref");
  return object == nullptr ? Value::null(CMPI_ref) : Value::reference(object->contents);
}

std::optional<Value> instanceOf(const CMPIInstance* instance) {
  const InstanceObject* object = InstanceObject::from(instance, "a value of type CMPI_instance");
  return object == nullptr ? Value::null(CMPI_instance)
                           : Value::embedded(object->contents.instance);
}

std::optional<Value> arrayOf(const CMPIArray* array, CMPIType type) {
  const ArrayObject* object = ArrayObject::from(array, "a value of an array type");
  if (object == nullptr) {
    return Value::null(type);
  }
  if (object->contents.elementType != (type & ~CMPI_ARRAY)) {
    return std::nullopt;
  }
  return Value::array(object->contents.elementType, object->contents.elements);
}

std::optional<Value> charsOf(const char* text) {
  return text == nullptr ? Value::null(CMPI_string) : Value::string(text);
}

std::optional<Value> objectFromCmpi(const CMPIValue& value, CMPIType type) {
  switch (type) {
    case CMPI_string:
      return textOf(value.string);
    case CMPI_charsptr:
      return charsOf(value.chars);
    case CMPI_dateTime:
      return dateTimeOf(value.dateTime);
    case CMPI_ref:
      return pathOf(value.ref);
    case CMPI_instance:
      return instanceOf(value.inst);
    default:
      return std::nullopt;
  }
}

std::optional<Value> scalarFromCmpi(const CMPIValue& value, CMPIType type) {
  switch (type) {
    case CMPI_boolean:
      return Value::boolean(value.boolean != 0);
    case CMPI_char16:
      return Value::number(type, value.char16);
    case CMPI_uint8:
      return Value::number(type, value.uint8);
    case CMPI_uint16:
      return Value::number(type, value.uint16);
    case CMPI_uint32:
      return Value::number(type, value.uint32);
    case CMPI_uint64:
      return Value::number(type, value.uint64);
    case CMPI_sint8:
      return Value::signedNumber(type, value.sint8);
    case CMPI_sint16:
      return Value::signedNumber(type, value.sint16);
    case CMPI_sint32:
      return Value::signedNumber(type, value.sint32);
    case CMPI_sint64:
      return Value::signedNumber(type, value.sint64);
    case CMPI_real32:
      return Value::real(type, static_cast<double>(value.real32));
    case CMPI_real64:
      return Value::real(type, value.real64);
    default:
      return objectFromCmpi(value, type);
  }
}

void integerToCmpi(CMPIValue& place, const Value& value) {
  // Every integer member starts at the union's first byte, so the widest one holds them all on a
  // little-endian machine; narrow ones are written as such all the same.
  switch (value.type()) {
    case CMPI_uint8:
      place.uint8 = static_cast<CMPIUint8>(value.asUnsigned());
      break;
    case CMPI_uint16:
    case CMPI_char16:
      place.uint16 = static_cast<CMPIUint16>(value.asUnsigned());
      break;
    case CMPI_uint32:
      place.uint32 = static_cast<CMPIUint32>(value.asUnsigned());
      break;
    case CMPI_uint64:
      place.uint64 = value.asUnsigned();
      break;
    case CMPI_sint8:
      place.sint8 = static_cast<CMPISint8>(value.asSigned());
      break;
    case CMPI_sint16:
      place.sint16 = static_cast<CMPISint16>(value.asSigned());
      break;
    case CMPI_sint32:
      place.sint32 = static_cast<CMPISint32>(value.asSigned());
      break;
    default:
      place.sint64 = value.asSigned();
      break;
  }
}

void objectToCmpi(Core& core, CMPIValue& place, const Value& value) {
  switch (value.type()) {
    case CMPI_string:
      place.string = makeString(
          core, value.hasText() ? std::optional(value.asText()) : std::nullopt, Origin::HandedOut);
      break;
    case CMPI_dateTime:
      place.dateTime = makeDateTime(core, value.asText(), Origin::HandedOut);
      break;
    case CMPI_ref:
      place.ref = makePath(core, value.asReference(), Origin::HandedOut);
      break;
    case CMPI_instance:
      place.inst = makeInstance(core, value.asInstance(), Origin::HandedOut);
      break;
    default:
      break;
  }
}

}  // namespace

std::optional<Value> fromCmpi(const CMPIValue* value, CMPIType type) {
  if (type == CMPI_chars) {
    return charsOf(reinterpret_cast<const char*>(value));
  }
  if (value == nullptr || type == CMPI_null) {
    return Value::null(type);
  }
  return (type & CMPI_ARRAY) != 0 ? arrayOf(value->array, type) : scalarFromCmpi(*value, type);
}

std::optional<Value> fromCmpi(const CMPIData& data) {
  if ((data.state & CMPI_nullValue) != 0) {
    return Value::null(data.type);
  }
  return fromCmpi(&data.value, data.type);
}

CMPIData toCmpi(Core& core, const Value& value) {
  CMPIData data{};
  data.type = value.type();
  if (value.isNull()) {
    data.state = CMPI_nullValue;
  } else if (value.isArray()) {
    data.value.array = makeArray(core, value.elementType(), value.elements(), Origin::HandedOut);
  } else if (data.type == CMPI_boolean) {
    data.value.boolean = value.asBoolean() ? 1 : 0;
  } else if (data.type == CMPI_real32) {
    data.value.real32 = static_cast<CMPIReal32>(value.asReal());
  } else if (data.type == CMPI_real64) {
    data.value.real64 = value.asReal();
  } else if (data.type < CMPI_ENC) {
    integerToCmpi(data.value, value);
  } else {
    objectToCmpi(core, data.value, value);
  }
  return data;
}

CMPIData notFoundData(CMPIStatus* rc, CMPIrc code) {
  setStatus(rc, code);
  CMPIData data{};
  data.state = CMPI_nullValue | CMPI_notFound;
  return data;
}

CMPIData valueAt(Core& core, const NamedValues& values, CMPICount index, CMPIString** name,
                 CMPIStatus* rc, CMPIrc missing) {
  if (index >= values.size()) {
    return notFoundData(rc, missing);
  }
  if (name != nullptr) {
    *name = makeString(core, values[index].name, Origin::HandedOut);
  }
  setStatus(rc, CMPI_RC_OK);
  return toCmpi(core, values[index].value);
}

CMPIData valueNamed(Core& core, const NamedValues& values, const char* name, CMPIStatus* rc,
                    CMPIrc missing) {
  const Value* value = name == nullptr ? nullptr : values.find(name);
  if (value == nullptr) {
    return notFoundData(rc, name == nullptr ? CMPI_RC_ERR_INVALID_PARAMETER : missing);
  }
  setStatus(rc, CMPI_RC_OK);
  return toCmpi(core, *value);
}

}  // namespace tvx::host
