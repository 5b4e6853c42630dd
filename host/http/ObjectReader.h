// Typed values, paths and instances out of the elements of a request.
#pragma once

#include <pugixml.hpp>
#include <string>

#include "cim/ClassCatalogue.h"
#include "cim/Value.h"

namespace tvx::host::http {

/// Reads elements of one request; types come from the class descriptions, never from the client.
/// Every function throws CimError (CMPI_RC_ERR_INVALID_PARAMETER, CMPI_RC_ERR_TYPE_MISMATCH,
/// CMPI_RC_ERR_NO_SUCH_PROPERTY) for what does not fit.
class ObjectReader {
 public:
  /// Paths that do not tell their namespace take `nameSpace`.
  ObjectReader(const ClassCatalogue& classes, std::string nameSpace, int depth = 0)
      : m_Classes(classes), m_NameSpace(std::move(nameSpace)), m_Depth(depth) {}

  /// Embedded instances may hold embedded instances this deep.
  static constexpr int depthLimit = 8;

  /// INSTANCENAME, CLASSNAME, or one of the elements that hold them with a namespace. Keys get
  /// their declared types. The host is dropped: it can only be this one.
  ObjectPath path(const pugi::xml_node& element) const;

  /// INSTANCE, its properties typed by its class. The path has no keys.
  Instance instance(const pugi::xml_node& element) const;

  /// What a PARAMVALUE or property element holds, as a value of the feature's type; null if empty.
  Value value(const FeatureData& feature, const pugi::xml_node& holder) const;

 private:
  ObjectPath instanceName(const pugi::xml_node& element, const std::string& nameSpace) const;
  NamedValue key(const pugi::xml_node& binding, const std::string& nameSpace) const;
  Value keyValue(const pugi::xml_node& element, const std::string& nameSpace) const;
  Value scalar(const FeatureData& feature, const pugi::xml_node& element) const;
  Value reference(const FeatureData& feature, const pugi::xml_node& element) const;
  Value embedded(const FeatureData& feature, const pugi::xml_node& element) const;

  const ClassCatalogue& m_Classes;
  std::string m_NameSpace;
  int m_Depth;  ///< embedded instances around this one
};

}  // namespace tvx::host::http
