#include "cim/JsonText.h"

#include <fmt/format.h>

#include "cim/DateTimeText.h"
#include "cim/PathText.h"
#include "cim/TypeNames.h"

namespace tvx::host {
namespace {

using Json = nlohmann::ordered_json;

[[noreturn]] void misfit(const Json& json, CMPIType type) {
  throw std::runtime_error(fmt::format("{} is no {}", json.dump(), typeName(type)));
}

bool fits(std::uint64_t value, CMPIType type) {
  return Value::number(type, value).asUnsigned() == value;
}
bool fitsSigned(std::int64_t value, CMPIType type) {
  return Value::signedNumber(type, value).asSigned() == value;
}

Value integerFromJson(const Json& json, CMPIType type) {
  if (type >= CMPI_SINT && json.is_number_integer() &&
      !(json.is_number_unsigned() &&
        json.get<std::uint64_t>() > static_cast<std::uint64_t>(INT64_MAX)) &&
      fitsSigned(json.get<std::int64_t>(), type)) {
    return Value::signedNumber(type, json.get<std::int64_t>());
  }
  if (type < CMPI_SINT && json.is_number_unsigned() && fits(json.get<std::uint64_t>(), type)) {
    return Value::number(type, json.get<std::uint64_t>());
  }
  misfit(json, type);
}

Value textFromJson(const Json& json, CMPIType type, const JsonContext& context) {
  if (!json.is_string()) {
    misfit(json, type);
  }
  const auto text = json.get<std::string>();
  if (type == CMPI_string) {
    return Value::string(text);
  }
  if (type == CMPI_ref) {
    return Value::reference(parsePath(text, context.nameSpace, context.classes));
  }
  if (!isDateTimeText(text)) {
    misfit(json, type);
  }
  return Value::dateTime(text);
}

Value scalarFromJson(const Json& json, CMPIType type, const JsonContext& context) {
  if (json.is_null()) {
    return Value::null(type);
  }
  if (type == CMPI_string || type == CMPI_dateTime || type == CMPI_ref) {
    return textFromJson(json, type, context);
  }
  if (type == CMPI_instance && json.is_object()) {
    return Value::embedded(instanceFromJson(json, context));
  }
  if (type == CMPI_boolean && json.is_boolean()) {
    return Value::boolean(json.get<bool>());
  }
  if ((type == CMPI_real32 || type == CMPI_real64) && json.is_number()) {
    return Value::real(type, json.get<double>());
  }
  if ((type >= CMPI_uint8 && type <= CMPI_sint64) || type == CMPI_char16) {
    return integerFromJson(json, type);
  }
  misfit(json, type);
}

Value guessedScalar(const Json& json) {
  switch (json.type()) {
    case Json::value_t::string:
      return Value::string(json.get<std::string>());
    case Json::value_t::boolean:
      return Value::boolean(json.get<bool>());
    case Json::value_t::number_unsigned:
      return Value::number(CMPI_uint64, json.get<std::uint64_t>());
    case Json::value_t::number_integer:
      return Value::signedNumber(CMPI_sint64, json.get<std::int64_t>());
    case Json::value_t::number_float:
      return Value::real(CMPI_real64, json.get<double>());
    case Json::value_t::null:
      return Value::null(CMPI_string);
    default:
      throw std::runtime_error(fmt::format("{} is no value", json.dump()));
  }
}

CMPIType typeOfJsonName(const std::string& name) {
  const bool array = name.size() > 2 && name.ends_with("[]");
  const auto type = typeOfName(array ? name.substr(0, name.size() - 2) : name);
  if (!type) {
    throw std::runtime_error(fmt::format("'{}' is no CIM type", name));
  }
  return static_cast<CMPIType>(*type | (array ? CMPI_ARRAY : 0));
}

Value propertyFromJson(const Json& json, const FeatureData* feature, const JsonContext& context) {
  if (feature == nullptr || (json.is_object() && json.contains("type"))) {
    return untypedFromJson(json, context);
  }
  const auto type = static_cast<CMPIType>(feature->cmpiType | (feature->isArray ? CMPI_ARRAY : 0));
  return valueFromJson(json, type, context);
}

std::vector<std::string> keyNamesOf(const Json& json, const ClassData* classData) {
  if (json.contains("keys")) {
    return json.at("keys").get<std::vector<std::string>>();
  }
  std::vector<std::string> names;
  if (classData != nullptr) {
    for (const FeatureData& feature : features(*classData)) {
      if (feature.isKey) {
        names.emplace_back(feature.name);
      }
    }
  }
  return names;
}

}  // namespace

Json toJson(const Value& value) {
  if (value.isNull()) {
    return nullptr;
  }
  if (value.isArray()) {
    Json list = Json::array();
    for (const Value& element : value.elements()) {
      list.push_back(toJson(element));
    }
    return list;
  }
  const CMPIType type = value.type();
  if (type == CMPI_boolean) {
    return value.asBoolean();
  }
  if (type == CMPI_real32 || type == CMPI_real64) {
    return type == CMPI_real32 ? Json::parse(value.display(), nullptr, false)
                               : Json(value.asReal());
  }
  if (type >= CMPI_SINT && type <= CMPI_sint64) {
    return value.asSigned();
  }
  if (type < CMPI_ENC) {
    return value.asUnsigned();
  }
  return type == CMPI_instance ? toJson(value.asInstance()) : Json(value.display());
}

Json toJson(const Instance& instance) {
  Json json;
  json["path"] = printPath(instance.path);
  json["class"] = instance.className();
  Json& properties = json["properties"] = Json::object();
  for (const NamedValue& property : instance.properties) {
    properties[property.name] = toJson(property.value);
  }
  return json;
}

Value valueFromJson(const Json& json, CMPIType type, const JsonContext& context) {
  const auto elementType = static_cast<CMPIType>(type & ~CMPI_ARRAY);
  if (elementType == type || json.is_null()) {
    return json.is_null() ? Value::null(type) : scalarFromJson(json, type, context);
  }
  if (!json.is_array()) {
    misfit(json, type);
  }
  Value::List list;
  for (const Json& element : json) {
    list.push_back(scalarFromJson(element, elementType, context));
  }
  return Value::array(elementType, std::move(list));
}

Value untypedFromJson(const Json& json, const JsonContext& context) {
  if (json.is_object()) {
    return valueFromJson(json.value("value", Json()),
                         typeOfJsonName(json.at("type").get<std::string>()), context);
  }
  if (!json.is_array()) {
    return guessedScalar(json);
  }
  Value::List list;
  for (const Json& element : json) {
    list.push_back(guessedScalar(element));
  }
  const CMPIType type = list.empty() ? CMPI_string : list.front().type();
  for (const Value& element : list) {
    if (element.type() != type) {
      throw std::runtime_error(fmt::format("the elements of {} differ in type", json.dump()));
    }
  }
  return Value::array(type, std::move(list));
}

Instance instanceFromJson(const Json& json, const JsonContext& context) {
  Instance instance;
  instance.path.className = json.at("class").get<std::string>();
  const ClassData* classData =
      context.classes == nullptr ? nullptr : context.classes->find(instance.className());
  if (classData != nullptr) {
    instance.path.className = classData->name;
  }
  instance.path.nameSpace = json.value("namespace", context.nameSpace);
  const Json properties = json.value("properties", Json::object());
  for (const auto& [name, value] : properties.items()) {
    const FeatureData* feature = classData == nullptr ? nullptr : findFeature(*classData, name);
    try {
      instance.properties.set(feature == nullptr ? name : feature->name,
                              propertyFromJson(value, feature, context));
    } catch (const std::exception& error) {
      throw std::runtime_error(
          fmt::format("property {} of {}: {}", name, instance.className(), error.what()));
    }
  }
  for (const std::string& name : keyNamesOf(json, classData)) {
    if (const Value* value = instance.properties.find(name)) {
      instance.path.keys.set(name, *value);
    }
  }
  return instance;
}

}  // namespace tvx::host
