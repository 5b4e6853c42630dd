// Class descriptions as the host programs see them: plain constant tables, generated from the MOF.
// Independent of the provider's own meta data, so that the two can be compared.
#pragma once

#include <cstddef>
#include <cstdint>

namespace tvx::host {

/// One parameter, property or reference.
struct FeatureData {
  const char* name;
  std::uint16_t
      cmpiType;  ///< CMPI scalar type code; CMPI_ref for references, CMPI_instance if embedded
  bool isArray;
  bool isKey;
  bool isIn;   ///< parameters only
  bool isOut;  ///< parameters only
  bool isWritable;
  const char* refClass;     ///< class of a reference or embedded instance, else null
  const char* defaultText;  ///< as MOF writes it, or null
  const char* originClass;  ///< class that introduced the feature
};

struct MethodData {
  const char* name;
  std::uint16_t returnType;  ///< CMPI type code
  const FeatureData* parameters;
  std::size_t parameterCount;
  const char* originClass;
};

struct ClassData {
  const char* name;
  const char* superName;  ///< null at a root
  bool isAssociation;
  bool isAggregation;
  bool isAbstract;
  bool isIndication;
  bool isServed;                ///< one of the provider's own classes
  const char* nameSpace;        ///< where its instances live; null if not served
  const FeatureData* features;  ///< properties and references, inherited ones first
  std::size_t featureCount;
  const MethodData* methods;  ///< inherited ones first
  std::size_t methodCount;
};

/// Every class, in no particular order.
extern const ClassData allClasses[];
extern const std::size_t allClassCount;

}  // namespace tvx::host
