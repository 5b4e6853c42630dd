#include "http/XmlWriter.h"

#include <fmt/format.h>

#include <algorithm>
#include <cmath>
#include <cstring>

#include "cim/TypeNames.h"
#include "http/XmlText.h"

namespace tvx::host::http {
namespace {

/// Reals always show a point or an exponent, so that they read as reals again.
std::string realText(const Value& value) {
  const double number = value.asReal();
  if (std::isnan(number)) {
    return "NaN";
  }
  if (std::isinf(number)) {
    return number > 0 ? "INF" : "-INF";
  }
  std::string text = value.type() == CMPI_real32 ? fmt::format("{}", static_cast<float>(number))
                                                 : fmt::format("{}", number);
  if (text.find_first_of(".e") == std::string::npos) {
    text += ".0";
  }
  return text;
}

/// UTF-8 of a character of the basic plane; halves of surrogate pairs stay broken and are replaced
/// on writing.
std::string characterText(std::uint64_t c) {
  const auto byte = [](std::uint64_t bits) { return static_cast<char>(bits); };
  if (c < 0x80) {
    return {byte(c)};
  }
  if (c < 0x800) {
    return {byte(0xC0 | (c >> 6)), byte(0x80 | (c & 0x3F))};
  }
  return {byte(0xE0 | (c >> 12)), byte(0x80 | ((c >> 6) & 0x3F)), byte(0x80 | (c & 0x3F))};
}

std::string scalarText(const Value& value) {
  switch (value.type()) {
    case CMPI_real32:
    case CMPI_real64:
      return realText(value);
    case CMPI_char16:
      return characterText(value.asUnsigned());
    case CMPI_boolean:
      return value.asBoolean() ? "true" : "false";
    default:
      return value.display();
  }
}

const char* keyValueType(CMPIType type) {
  if (type == CMPI_boolean) {
    return "boolean";
  }
  const bool textual = type == CMPI_string || type == CMPI_dateTime || type == CMPI_char16;
  return textual || type == CMPI_null ? "string" : "numeric";
}

bool isEmbedded(CMPIType type) {
  return (type & ~CMPI_ARRAY) == CMPI_instance;
}

/// A default out of a class description: quotes of texts go.
std::string defaultText(const FeatureData& feature) {
  std::string_view text = feature.defaultText;
  if (text.size() >= 2 && text.front() == '"') {
    text = text.substr(1, text.size() - 2);
  }
  std::string result;
  for (std::size_t i = 0; i < text.size(); ++i) {
    if (text[i] == '\\' && i + 1 < text.size()) {
      ++i;
    }
    result += text[i];
  }
  return result;
}

}  // namespace

std::string xmlTypeName(CMPIType elementType) {
  switch (elementType) {
    case CMPI_ref:
      return "reference";
    case CMPI_instance:
    case CMPI_null:
      return "string";
    default:
      return typeName(elementType);
  }
}

bool Selection::includes(std::string_view property) const {
  if (asClass != nullptr && findFeature(*asClass, property) == nullptr) {
    return false;
  }
  return !properties || std::any_of(properties->begin(), properties->end(),
                                    [&](const auto& each) { return sameName(each, property); });
}

void XmlWriter::text(std::string_view element, std::string_view text) {
  m_Out += fmt::format("<{}>", element);
  appendEscaped(m_Out, text);
  m_Out += fmt::format("</{}>", element);
}

void XmlWriter::scalar(const Value& value) {
  if (value.type() == CMPI_ref) {
    m_Out += "<VALUE.REFERENCE>";
    instancePath(value.asReference(), {});
    m_Out += "</VALUE.REFERENCE>";
    return;
  }
  if (value.type() == CMPI_instance) {
    std::string inner;
    XmlWriter(inner, m_Classes, m_Host).instance(value.asInstance(), {});
    text("VALUE", inner);
    return;
  }
  text("VALUE", scalarText(value));
}

void XmlWriter::value(const Value& value) {
  if (value.isNull()) {
    return;
  }
  if (!value.isArray()) {
    scalar(value);
    return;
  }
  const bool references = value.elementType() == CMPI_ref;
  m_Out += references ? "<VALUE.REFARRAY>" : "<VALUE.ARRAY>";
  for (const Value& element : value.elements()) {
    if (element.isNull()) {
      m_Out += "<VALUE.NULL/>";
    } else {
      scalar(element);
    }
  }
  m_Out += references ? "</VALUE.REFARRAY>" : "</VALUE.ARRAY>";
}

void XmlWriter::keyBinding(const NamedValue& key) {
  m_Out += "<KEYBINDING";
  appendAttribute(m_Out, "NAME", key.name);
  m_Out += ">";
  if (key.value.type() == CMPI_ref && !key.value.isNull()) {
    scalar(key.value);
  } else {
    m_Out += "<KEYVALUE";
    appendAttribute(m_Out, "VALUETYPE", keyValueType(key.value.type()));
    appendAttribute(m_Out, "TYPE", xmlTypeName(key.value.type()));
    m_Out += ">";
    if (!key.value.isNull() && !key.value.isArray()) {
      appendEscaped(m_Out, scalarText(key.value));
    }
    m_Out += "</KEYVALUE>";
  }
  m_Out += "</KEYBINDING>";
}

void XmlWriter::instanceName(const ObjectPath& path) {
  m_Out += "<INSTANCENAME";
  appendAttribute(m_Out, "CLASSNAME", path.className);
  m_Out += ">";
  for (const NamedValue& key : path.keys) {
    keyBinding(key);
  }
  m_Out += "</INSTANCENAME>";
}

void XmlWriter::localNameSpacePath(std::string_view nameSpace) {
  m_Out += "<LOCALNAMESPACEPATH>";
  while (!nameSpace.empty()) {
    const std::size_t slash = std::min(nameSpace.find('/'), nameSpace.size());
    m_Out += "<NAMESPACE";
    appendAttribute(m_Out, "NAME", nameSpace.substr(0, slash));
    m_Out += "/>";
    nameSpace.remove_prefix(std::min(slash + 1, nameSpace.size()));
  }
  m_Out += "</LOCALNAMESPACEPATH>";
}

void XmlWriter::instancePath(const ObjectPath& path, const std::string& nameSpace) {
  const std::string& place = path.nameSpace.empty() ? nameSpace : path.nameSpace;
  if (place.empty()) {
    instanceName(path);
    return;
  }
  m_Out += "<INSTANCEPATH><NAMESPACEPATH>";
  text("HOST", path.host.empty() ? m_Host : path.host);
  localNameSpacePath(place);
  m_Out += "</NAMESPACEPATH>";
  instanceName(path);
  m_Out += "</INSTANCEPATH>";
}

void XmlWriter::property(const std::string& name, const Value& value, const ClassData* classData,
                         bool withClassOrigin) {
  const FeatureData* feature = classData == nullptr ? nullptr : findFeature(*classData, name);
  const FeatureData* declared = value.type() == CMPI_null ? feature : nullptr;
  const CMPIType type = declared != nullptr ? declared->cmpiType : value.elementType();
  const bool array = declared != nullptr ? declared->isArray : value.isArray();
  const char* element = array              ? "PROPERTY.ARRAY"
                        : type == CMPI_ref ? "PROPERTY.REFERENCE"
                                           : "PROPERTY";
  m_Out += fmt::format("<{}", element);
  appendAttribute(m_Out, "NAME", name);
  if (type == CMPI_ref && !array) {
    if (feature != nullptr && feature->refClass != nullptr) {
      appendAttribute(m_Out, "REFERENCECLASS", feature->refClass);
    }
  } else {
    appendAttribute(m_Out, "TYPE", xmlTypeName(type));
  }
  if (withClassOrigin && feature != nullptr) {
    appendAttribute(m_Out, "CLASSORIGIN", feature->originClass);
  }
  if (isEmbedded(type)) {
    appendAttribute(m_Out, "EmbeddedObject", "instance");
  }
  m_Out += ">";
  this->value(value);
  m_Out += fmt::format("</{}>", element);
}

void XmlWriter::instance(const Instance& instance, const Selection& selection) {
  const ClassData* classData = m_Classes.find(instance.className());
  m_Out += "<INSTANCE";
  appendAttribute(m_Out, "CLASSNAME", instance.className());
  m_Out += ">";
  for (const NamedValue& each : instance.properties) {
    if (selection.includes(each.name)) {
      property(each.name, each.value, classData, selection.withClassOrigin);
    }
  }
  m_Out += "</INSTANCE>";
}

void XmlWriter::className(std::string_view name) {
  m_Out += "<CLASSNAME";
  appendAttribute(m_Out, "NAME", name);
  m_Out += "/>";
}

void XmlWriter::qualifier(std::string_view name, bool value) {
  m_Out += "<QUALIFIER";
  appendAttribute(m_Out, "NAME", name);
  m_Out += " TYPE=\"boolean\">";
  text("VALUE", value ? "true" : "false");
  m_Out += "</QUALIFIER>";
}

void XmlWriter::origin(const ClassData& classData, const char* originClass,
                       const Selection& selection) {
  if (selection.withClassOrigin) {
    appendAttribute(m_Out, "CLASSORIGIN", originClass);
  }
  appendAttribute(m_Out, "PROPAGATED",
                  std::strcmp(originClass, classData.name) == 0 ? "false" : "true");
}

void XmlWriter::feature(const ClassData& classData, const FeatureData& feature,
                        const Selection& selection) {
  const bool reference = feature.cmpiType == CMPI_ref && !feature.isArray;
  const char* element = reference         ? "PROPERTY.REFERENCE"
                        : feature.isArray ? "PROPERTY.ARRAY"
                                          : "PROPERTY";
  m_Out += fmt::format("<{}", element);
  appendAttribute(m_Out, "NAME", feature.name);
  if (!reference) {
    appendAttribute(m_Out, "TYPE", xmlTypeName(feature.cmpiType));
  } else if (feature.refClass != nullptr) {
    appendAttribute(m_Out, "REFERENCECLASS", feature.refClass);
  }
  origin(classData, feature.originClass, selection);
  m_Out += ">";
  if (selection.withQualifiers && feature.isKey) {
    qualifier("Key");
  }
  if (selection.withQualifiers && feature.isWritable) {
    qualifier("Write");
  }
  if (selection.withQualifiers && isEmbedded(feature.cmpiType)) {
    qualifier("EmbeddedObject");
  }
  if (feature.defaultText != nullptr) {
    text("VALUE", defaultText(feature));
  }
  m_Out += fmt::format("</{}>", element);
}

void XmlWriter::parameter(const FeatureData& parameter, const Selection& selection) {
  const bool reference = parameter.cmpiType == CMPI_ref;
  const char* element = reference
                            ? (parameter.isArray ? "PARAMETER.REFARRAY" : "PARAMETER.REFERENCE")
                            : (parameter.isArray ? "PARAMETER.ARRAY" : "PARAMETER");
  m_Out += fmt::format("<{}", element);
  appendAttribute(m_Out, "NAME", parameter.name);
  if (!reference) {
    appendAttribute(m_Out, "TYPE", xmlTypeName(parameter.cmpiType));
  } else if (parameter.refClass != nullptr) {
    appendAttribute(m_Out, "REFERENCECLASS", parameter.refClass);
  }
  m_Out += ">";
  if (selection.withQualifiers) {
    qualifier("In", parameter.isIn);
    if (parameter.isOut) {
      qualifier("Out");
    }
    if (isEmbedded(parameter.cmpiType)) {
      qualifier("EmbeddedObject");
    }
  }
  m_Out += fmt::format("</{}>", element);
}

void XmlWriter::method(const ClassData& classData, const MethodData& method,
                       const Selection& selection) {
  m_Out += "<METHOD";
  appendAttribute(m_Out, "NAME", method.name);
  appendAttribute(m_Out, "TYPE", xmlTypeName(method.returnType));
  origin(classData, method.originClass, selection);
  m_Out += ">";
  for (const FeatureData& each : parameters(method)) {
    parameter(each, selection);
  }
  m_Out += "</METHOD>";
}

void XmlWriter::classElement(const ClassData& classData, const Selection& selection) {
  m_Out += "<CLASS";
  appendAttribute(m_Out, "NAME", classData.name);
  if (classData.superName != nullptr) {
    appendAttribute(m_Out, "SUPERCLASS", classData.superName);
  }
  m_Out += ">";
  const std::pair<const char*, bool> qualifiers[] = {{"Association", classData.isAssociation},
                                                     {"Aggregation", classData.isAggregation},
                                                     {"Abstract", classData.isAbstract},
                                                     {"Indication", classData.isIndication}};
  for (const auto& [name, has] : qualifiers) {
    if (has && selection.withQualifiers) {
      qualifier(name);
    }
  }
  const auto wanted = [&](const char* origin) {
    return !selection.localOnly || std::strcmp(origin, classData.name) == 0;
  };
  for (const FeatureData& each : features(classData)) {
    if (wanted(each.originClass) && selection.includes(each.name)) {
      feature(classData, each, selection);
    }
  }
  for (const MethodData& each : methods(classData)) {
    if (wanted(each.originClass)) {
      method(classData, each, selection);
    }
  }
  m_Out += "</CLASS>";
}

void XmlWriter::parameterValue(const std::string& name, const Value& value,
                               const FeatureData* parameter) {
  const bool untyped = value.type() == CMPI_null && parameter != nullptr;
  const CMPIType type = untyped ? parameter->cmpiType : value.elementType();
  m_Out += "<PARAMVALUE";
  appendAttribute(m_Out, "NAME", name);
  appendAttribute(m_Out, "PARAMTYPE", xmlTypeName(type));
  if (isEmbedded(type)) {
    appendAttribute(m_Out, "EmbeddedObject", "instance");
  }
  m_Out += ">";
  this->value(value);
  m_Out += "</PARAMVALUE>";
}

void XmlWriter::returnValue(const Value& value) {
  if (value.isNull()) {
    return;
  }
  m_Out += "<RETURNVALUE";
  appendAttribute(m_Out, "PARAMTYPE", xmlTypeName(value.elementType()));
  m_Out += ">";
  this->value(value);
  m_Out += "</RETURNVALUE>";
}

}  // namespace tvx::host::http
