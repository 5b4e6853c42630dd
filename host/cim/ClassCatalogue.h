// Look-ups over a table of class descriptions.
#pragma once

#include <map>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "schema/ClassData.h"

namespace tvx::host {

/// Index over a constant class table, which must outlive it. Constant after construction, so that
/// any number of threads may use one.
class ClassCatalogue {
 public:
  ClassCatalogue(const ClassData* classes, std::size_t count);

  /// Class of that name in any case of letters, or null.
  const ClassData* find(std::string_view name) const;
  /// True if `name` is `base` or derives from it; false if either is unknown and they differ.
  bool isA(std::string_view name, std::string_view base) const;
  /// Classes of the provider that are `base` or derive from it, sorted by name.
  std::vector<const ClassData*> servedSubclasses(std::string_view base) const;
  /// Association classes of the provider that are `base` or derive from it ("" for all), by name.
  std::vector<const ClassData*> servedAssociations(std::string_view base) const;
  /// All classes, sorted by name.
  std::vector<const ClassData*> all() const;
  /// At most `limit` class names that look like `name`, the nearest first.
  std::vector<std::string> nearNames(std::string_view name, std::size_t limit = 3) const;
  /// True if a class of the table lives in that namespace.
  bool knowsNameSpace(std::string_view nameSpace) const;

 private:
  std::map<std::string, const ClassData*> m_ByName;  ///< keyed by the name in lower case
};

inline std::span<const FeatureData> features(const ClassData& classData) {
  return {classData.features, classData.featureCount};
}
inline std::span<const MethodData> methods(const ClassData& classData) {
  return {classData.methods, classData.methodCount};
}
inline std::span<const FeatureData> parameters(const MethodData& method) {
  return {method.parameters, method.parameterCount};
}

/// Property or reference of that name (any case), or null.
const FeatureData* findFeature(const ClassData& classData, std::string_view name);
/// Method of that name (any case), or null.
const MethodData* findMethod(const ClassData& classData, std::string_view name);
/// Parameter of that name (any case), or null.
const FeatureData* findParameter(const MethodData& method, std::string_view name);
/// Out of `candidates`, at most `limit` that look like `name`, the nearest first.
std::vector<std::string> nearest(std::string_view name, const std::vector<std::string>& candidates,
                                 std::size_t limit);

}  // namespace tvx::host
