// Values, paths, instances and classes as CIM-XML elements.
#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "cim/ClassCatalogue.h"
#include "cim/Value.h"

namespace tvx::host::http {

/// What a client wants to see of instances and classes.
struct Selection {
  /// Nothing for all; else only properties of these names (any case).
  std::optional<std::vector<std::string>> properties;
  /// With a class, only properties that this class has too.
  const ClassData* asClass = nullptr;
  bool withClassOrigin = false;
  bool withQualifiers = true;  ///< classes only
  bool localOnly = false;      ///< classes only: without what is inherited

  bool includes(std::string_view property) const;
};

/// Appends elements to a text.
class XmlWriter {
 public:
  /// `classes` tells types that a null value does not; `host` is this server's name in paths.
  XmlWriter(std::string& out, const ClassCatalogue& classes, std::string host)
      : m_Out(out), m_Classes(classes), m_Host(std::move(host)) {}

  /// VALUE, VALUE.ARRAY, VALUE.REFERENCE or VALUE.REFARRAY; nothing for null.
  void value(const Value& value);
  /// INSTANCENAME.
  void instanceName(const ObjectPath& path);
  /// INSTANCEPATH; a path without namespace takes `nameSpace`.
  void instancePath(const ObjectPath& path, const std::string& nameSpace);
  /// LOCALNAMESPACEPATH.
  void localNameSpacePath(std::string_view nameSpace);
  /// INSTANCE.
  void instance(const Instance& instance, const Selection& selection);
  /// CLASSNAME.
  void className(std::string_view name);
  /// CLASS with its features.
  void classElement(const ClassData& classData, const Selection& selection);
  /// PARAMVALUE; a null value takes its type from `parameter`, which may be null.
  void parameterValue(const std::string& name, const Value& value, const FeatureData* parameter);
  /// RETURNVALUE.
  void returnValue(const Value& value);

 private:
  void scalar(const Value& value);
  void property(const std::string& name, const Value& value, const ClassData* classData,
                bool withClassOrigin);
  void keyBinding(const NamedValue& key);
  void origin(const ClassData& classData, const char* originClass, const Selection& selection);
  void feature(const ClassData& classData, const FeatureData& feature, const Selection& selection);
  void method(const ClassData& classData, const MethodData& method, const Selection& selection);
  void parameter(const FeatureData& parameter, const Selection& selection);
  void qualifier(std::string_view name, bool value = true);
  void text(std::string_view element, std::string_view text);

  std::string& m_Out;
  const ClassCatalogue& m_Classes;
  std::string m_Host;
};

/// Name of a type as attributes write it: "uint16", "reference", "string" for embedded instances.
std::string xmlTypeName(CMPIType elementType);

}  // namespace tvx::host::http
