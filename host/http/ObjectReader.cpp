#include "http/ObjectReader.h"

#include <fmt/format.h>

#include <string_view>

#include "cim/PathText.h"
#include "cim/ScalarText.h"
#include "cim/TypeNames.h"
#include "cmpi/cmpidt.h"
#include "http/CimErrors.h"
#include "http/CimMessage.h"
#include "http/XmlText.h"

namespace tvx::host::http {
namespace {

[[noreturn]] void invalid(const std::string& text) {
  throw CimError(CMPI_RC_ERR_INVALID_PARAMETER, text);
}

[[noreturn]] void mismatch(const FeatureData& feature, const std::string& text) {
  throw CimError(CMPI_RC_ERR_TYPE_MISMATCH,
                 fmt::format("'{}' does not fit {} of type {}{}", text, feature.name,
                             typeName(feature.cmpiType), feature.isArray ? "[]" : ""));
}

bool is(const pugi::xml_node& element, std::string_view name) {
  return element.name() == name;
}

bool isArrayElement(const pugi::xml_node& element) {
  return is(element, "VALUE.ARRAY") || is(element, "VALUE.REFARRAY");
}

std::string nameAttribute(const pugi::xml_node& element, const char* attribute) {
  std::string name = element.attribute(attribute).value();
  if (name.empty()) {
    invalid(fmt::format("{} without {}", element.name(), attribute));
  }
  return name;
}

/// The namespace path inside NAMESPACEPATH or a local path.
std::string nameSpaceIn(const pugi::xml_node& element) {
  const pugi::xml_node full = element.child("NAMESPACEPATH");
  return readNameSpace((full ? full : element).child("LOCALNAMESPACEPATH"));
}

}  // namespace

ObjectPath ObjectReader::path(const pugi::xml_node& element) const {
  ObjectPath result;
  if (is(element, "INSTANCENAME")) {
    result = instanceName(element, m_NameSpace);
  } else if (is(element, "CLASSNAME")) {
    result.nameSpace = m_NameSpace;
    result.className = nameAttribute(element, "NAME");
  } else if (is(element, "INSTANCEPATH") || is(element, "LOCALINSTANCEPATH")) {
    result = instanceName(element.child("INSTANCENAME"), nameSpaceIn(element));
  } else if (is(element, "CLASSPATH") || is(element, "LOCALCLASSPATH")) {
    result.nameSpace = nameSpaceIn(element);
    result.className = nameAttribute(element.child("CLASSNAME"), "NAME");
  } else {
    invalid(fmt::format("an object path is wanted, found '{}'", element.name()));
  }
  try {
    typeKeys(result, m_Classes);
  } catch (const PathError& error) {
    invalid(error.what());
  }
  return result;
}

ObjectPath ObjectReader::instanceName(const pugi::xml_node& element,
                                      const std::string& nameSpace) const {
  ObjectPath result;
  result.nameSpace = nameSpace;
  result.className = nameAttribute(element, "CLASSNAME");
  for (const pugi::xml_node& binding : element.children("KEYBINDING")) {
    NamedValue each = key(binding, nameSpace);
    if (result.keys.find(each.name) != nullptr) {
      invalid(fmt::format("key {} is there twice", each.name));
    }
    result.keys.set(each.name, std::move(each.value));
  }
  // A class with one key may leave out its name.
  const pugi::xml_node only = firstElement(element);
  const ClassData* classData = m_Classes.find(result.className);
  if ((is(only, "KEYVALUE") || is(only, "VALUE.REFERENCE")) && classData != nullptr) {
    for (const FeatureData& feature : features(*classData)) {
      if (feature.isKey && result.keys.empty()) {
        result.keys.set(feature.name, keyValue(only, nameSpace));
      }
    }
  }
  return result;
}

NamedValue ObjectReader::key(const pugi::xml_node& binding, const std::string& nameSpace) const {
  return {nameAttribute(binding, "NAME"), keyValue(firstElement(binding), nameSpace)};
}

Value ObjectReader::keyValue(const pugi::xml_node& element, const std::string& nameSpace) const {
  if (is(element, "VALUE.REFERENCE")) {
    return Value::reference(ObjectReader(m_Classes, nameSpace).path(firstElement(element)));
  }
  if (!is(element, "KEYVALUE")) {
    invalid("a key without value");
  }
  const std::string text = elementText(element);
  const std::string_view kind = element.attribute("VALUETYPE").as_string("string");
  if (kind == "string") {
    return Value::string(text);
  }
  const std::string word(trimmed(text));
  const CMPIType type = kind == "boolean"       ? CMPI_boolean
                        : word.starts_with('-') ? CMPI_sint64
                                                : CMPI_uint64;
  std::optional<Value> value = scalarFromText(type, word);
  if (!value || (kind != "boolean" && kind != "numeric")) {
    invalid(fmt::format("'{}' is no {} key", text, kind));
  }
  return *std::move(value);
}

Instance ObjectReader::instance(const pugi::xml_node& element) const {
  if (!is(element, "INSTANCE")) {
    invalid(fmt::format("an instance is wanted, found '{}'", element.name()));
  }
  Instance result;
  result.path.nameSpace = m_NameSpace;
  result.path.className = nameAttribute(element, "CLASSNAME");
  const ClassData* classData = m_Classes.find(result.path.className);
  if (classData == nullptr) {
    throw CimError(CMPI_RC_ERR_INVALID_CLASS, fmt::format("no class '{}'", result.path.className));
  }
  result.path.className = classData->name;
  for (const pugi::xml_node& child : element.children()) {
    if (!std::string_view(child.name()).starts_with("PROPERTY")) {
      continue;
    }
    const std::string name = nameAttribute(child, "NAME");
    const FeatureData* feature = findFeature(*classData, name);
    if (feature == nullptr) {
      throw CimError(CMPI_RC_ERR_NO_SUCH_PROPERTY,
                     fmt::format("class {} has no property '{}'", classData->name, name));
    }
    if (result.properties.find(feature->name) != nullptr) {
      invalid(fmt::format("property {} is there twice", feature->name));
    }
    result.properties.set(feature->name, value(*feature, child));
  }
  return result;
}

Value ObjectReader::value(const FeatureData& feature, const pugi::xml_node& holder) const {
  pugi::xml_node element = firstElement(holder);
  while (is(element, "QUALIFIER")) {
    element = element.next_sibling();
  }
  const auto arrayType = static_cast<CMPIType>(feature.cmpiType | CMPI_ARRAY);
  if (!element) {
    return Value::null(feature.isArray ? arrayType : feature.cmpiType);
  }
  if (!feature.isArray) {
    return scalar(feature, element);
  }
  Value::List elements;
  if (!isArrayElement(element)) {
    // Clients without knowledge of the class write an array of one element like that.
    elements.push_back(scalar(feature, element));
    return Value::array(feature.cmpiType, std::move(elements));
  }
  for (const pugi::xml_node& each : element.children()) {
    elements.push_back(is(each, "VALUE.NULL") ? Value::null(feature.cmpiType)
                                              : scalar(feature, each));
  }
  return Value::array(feature.cmpiType, std::move(elements));
}

Value ObjectReader::scalar(const FeatureData& feature, const pugi::xml_node& element) const {
  if (feature.cmpiType == CMPI_ref) {
    return reference(feature, element);
  }
  if (feature.cmpiType == CMPI_instance) {
    return embedded(feature, element);
  }
  if (!is(element, "VALUE")) {
    mismatch(feature, element.name());
  }
  const std::string text = elementText(element);
  const bool isText = feature.cmpiType == CMPI_string || feature.cmpiType == CMPI_char16;
  std::optional<Value> value =
      scalarFromText(feature.cmpiType, isText ? text : std::string(trimmed(text)));
  if (!value) {
    mismatch(feature, text);
  }
  return *std::move(value);
}

Value ObjectReader::reference(const FeatureData& feature, const pugi::xml_node& element) const {
  if (is(element, "VALUE.REFERENCE")) {
    return Value::reference(path(firstElement(element)));
  }
  if (!is(element, "VALUE")) {
    mismatch(feature, element.name());
  }
  const std::string text = elementText(element);
  try {
    return Value::reference(parsePath(text, m_NameSpace, &m_Classes));
  } catch (const PathError&) {
    mismatch(feature, text);
  }
}

Value ObjectReader::embedded(const FeatureData& feature, const pugi::xml_node& element) const {
  if (is(element, "INSTANCE")) {
    return Value::embedded(instance(element));
  }
  std::string text = elementText(element);
  if (text.empty()) {
    return Value::null(feature.cmpiType);
  }
  if (m_Depth == depthLimit) {
    invalid(fmt::format("instances embedded deeper than {}", depthLimit));
  }
  pugi::xml_document inner;
  try {
    const ObjectReader reader(m_Classes, m_NameSpace, m_Depth + 1);
    return Value::embedded(reader.instance(parseXml(inner, text)));
  } catch (const MessageError& error) {
    throw CimError(CMPI_RC_ERR_INVALID_PARAMETER,
                   fmt::format("{} holds no instance: {}", feature.name, error.what()));
  }
}

}  // namespace tvx::host::http
