#include "cim/ClassCatalogue.h"

#include <algorithm>
#include <numeric>

#include "cim/Value.h"

namespace tvx::host {
namespace {

std::string lowered(std::string_view text) {
  std::string result(text);
  std::transform(result.begin(), result.end(), result.begin(), [](char c) {
    return (c >= 'A' && c <= 'Z') ? static_cast<char>(c - 'A' + 'a') : c;
  });
  return result;
}

/// Number of single character edits between two texts.
std::size_t editDistance(std::string_view a, std::string_view b) {
  std::vector<std::size_t> row(b.size() + 1);
  std::iota(row.begin(), row.end(), std::size_t{0});
  for (std::size_t i = 1; i <= a.size(); ++i) {
    std::size_t diagonal = row[0];
    row[0] = i;
    for (std::size_t j = 1; j <= b.size(); ++j) {
      const std::size_t replace = diagonal + (a[i - 1] == b[j - 1] ? 0 : 1);
      diagonal = row[j];
      row[j] = std::min({row[j] + 1, row[j - 1] + 1, replace});
    }
  }
  return row[b.size()];
}

std::size_t dissimilarity(const std::string& name, const std::string& candidate) {
  const std::size_t underscore = candidate.find('_');
  const std::string bare =
      underscore == std::string::npos ? candidate : candidate.substr(underscore + 1);
  return std::min(editDistance(name, candidate), editDistance(name, bare));
}

template <class T>
const T* findNamed(std::span<const T> items, std::string_view name) {
  for (const T& item : items) {
    if (sameName(item.name, name)) {
      return &item;
    }
  }
  return nullptr;
}

}  // namespace

ClassCatalogue::ClassCatalogue(const ClassData* classes, std::size_t count) {
  for (std::size_t i = 0; i < count; ++i) {
    m_ByName.emplace(lowered(classes[i].name), &classes[i]);
  }
}

const ClassData* ClassCatalogue::find(std::string_view name) const {
  const auto found = m_ByName.find(lowered(name));
  return found == m_ByName.end() ? nullptr : found->second;
}

bool ClassCatalogue::isA(std::string_view name, std::string_view base) const {
  if (sameName(name, base)) {
    return true;
  }
  const ClassData* classData = find(name);
  for (std::size_t depth = 0; classData != nullptr && depth <= m_ByName.size(); ++depth) {
    if (sameName(classData->name, base)) {
      return true;
    }
    classData = classData->superName == nullptr ? nullptr : find(classData->superName);
  }
  return false;
}

std::vector<const ClassData*> ClassCatalogue::servedSubclasses(std::string_view base) const {
  std::vector<const ClassData*> result;
  for (const auto& [key, classData] : m_ByName) {
    if (classData->isServed && isA(classData->name, base)) {
      result.push_back(classData);
    }
  }
  return result;
}

std::vector<const ClassData*> ClassCatalogue::servedAssociations(std::string_view base) const {
  std::vector<const ClassData*> result;
  for (const auto& [key, classData] : m_ByName) {
    if (classData->isServed && classData->isAssociation &&
        (base.empty() || isA(classData->name, base))) {
      result.push_back(classData);
    }
  }
  return result;
}

std::vector<const ClassData*> ClassCatalogue::all() const {
  std::vector<const ClassData*> result;
  for (const auto& [key, classData] : m_ByName) {
    result.push_back(classData);
  }
  return result;
}

std::vector<std::string> ClassCatalogue::nearNames(std::string_view name, std::size_t limit) const {
  std::vector<std::string> names;
  for (const auto& [key, classData] : m_ByName) {
    names.emplace_back(classData->name);
  }
  return nearest(name, names, limit);
}

bool ClassCatalogue::knowsNameSpace(std::string_view nameSpace) const {
  return std::any_of(m_ByName.begin(), m_ByName.end(), [&](const auto& entry) {
    return entry.second->nameSpace != nullptr && sameName(entry.second->nameSpace, nameSpace);
  });
}

const FeatureData* findFeature(const ClassData& classData, std::string_view name) {
  return findNamed(features(classData), name);
}

const MethodData* findMethod(const ClassData& classData, std::string_view name) {
  return findNamed(methods(classData), name);
}

const FeatureData* findParameter(const MethodData& method, std::string_view name) {
  return findNamed(parameters(method), name);
}

std::vector<std::string> nearest(std::string_view name, const std::vector<std::string>& candidates,
                                 std::size_t limit) {
  const std::string wanted = lowered(name);
  std::vector<std::pair<std::size_t, std::string>> scored;
  for (const std::string& candidate : candidates) {
    const std::size_t score = dissimilarity(wanted, lowered(candidate));
    if (score <= std::max<std::size_t>(2, wanted.size() / 3)) {
      scored.emplace_back(score, candidate);
    }
  }
  std::sort(scored.begin(), scored.end());
  std::vector<std::string> result;
  for (std::size_t i = 0; i < std::min(limit, scored.size()); ++i) {
    result.push_back(scored[i].second);
  }
  return result;
}

}  // namespace tvx::host
