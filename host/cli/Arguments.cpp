#include "cli/Arguments.h"

#include <fmt/format.h>

#include <cerrno>
#include <cstring>
#include <fstream>
#include <iterator>

#include "cim/JsonText.h"
#include "cim/ScalarText.h"
#include "cli/ExitCode.h"

namespace tvx::host {
namespace {

using Json = nlohmann::ordered_json;

std::string readFile(const std::string& name) {
  std::ifstream stream(name, std::ios::binary);
  if (!stream) {
    throw CommandError(ExitCode::File,
                       fmt::format("cannot read the file '{}': {}", name, std::strerror(errno)));
  }
  return {std::istreambuf_iterator<char>(stream), std::istreambuf_iterator<char>()};
}

/// Reads one value of one feature.
class ValueReader {
 public:
  ValueReader(const FeatureData& feature, const ClassCatalogue& classes,
              const PathResolver& resolve)
      : m_Feature(feature), m_Classes(classes), m_Resolve(resolve) {}

  Value read(const std::string& text) const {
    if (!m_Feature.isArray) {
      return scalar(text);
    }
    if (m_Feature.cmpiType == CMPI_uint8 && text.starts_with('@')) {
      return bytes(readFile(text.substr(1)));
    }
    if (text.starts_with('[')) {
      return fromJson(text, static_cast<CMPIType>(m_Feature.cmpiType | CMPI_ARRAY));
    }
    Value::List elements;
    // A path has commas of its own, so that a list of several paths has to be JSON.
    if (m_Feature.cmpiType == CMPI_ref && !text.empty()) {
      elements.push_back(scalar(text));
      return Value::array(m_Feature.cmpiType, std::move(elements));
    }
    for (const std::string& part : split(text)) {
      elements.push_back(scalar(part));
    }
    return Value::array(m_Feature.cmpiType, std::move(elements));
  }

 private:
  [[noreturn]] void fail(const std::string& text) const {
    throw CommandError(ExitCode::BadArgument,
                       fmt::format("'{}' does not fit '{}', which takes {}", text,
                                   signatureOf(m_Feature), fittingText(m_Feature.cmpiType)));
  }

  Value scalar(const std::string& text) const {
    const CMPIType type = m_Feature.cmpiType;
    if (type == CMPI_ref) {
      return Value::reference(m_Resolve(text));
    }
    if (type == CMPI_instance) {
      return fromJson(text.starts_with('@') ? readFile(text.substr(1)) : text, type);
    }
    std::optional<Value> value = scalarFromText(type, text);
    if (!value) {
      fail(text);
    }
    return *std::move(value);
  }

  Value fromJson(const std::string& text, CMPIType type) const {
    try {
      return valueFromJson(Json::parse(text), type, JsonContext{&m_Classes, {}});
    } catch (const std::exception& error) {
      throw CommandError(ExitCode::BadArgument,
                         fmt::format("'{}': {}", signatureOf(m_Feature), error.what()));
    }
  }

  static Value bytes(const std::string& content) {
    Value::List elements;
    elements.reserve(content.size());
    for (const char c : content) {
      elements.push_back(Value::number(CMPI_uint8, static_cast<unsigned char>(c)));
    }
    return Value::array(CMPI_uint8, std::move(elements));
  }

  /// Splits at commas.
  static std::vector<std::string> split(const std::string& text) {
    std::vector<std::string> parts;
    if (text.empty()) {
      return parts;
    }
    std::size_t start = 0;
    for (std::size_t comma; (comma = text.find(',', start)) != std::string::npos;
         start = comma + 1) {
      parts.push_back(text.substr(start, comma - start));
    }
    parts.push_back(text.substr(start));
    return parts;
  }

  const FeatureData& m_Feature;
  const ClassCatalogue& m_Classes;
  const PathResolver& m_Resolve;
};

struct Word {
  std::string name;
  std::string text;
};

Word splitWord(const std::string& word) {
  const std::size_t equals = word.find('=');
  if (equals == std::string::npos || equals == 0) {
    throw CommandError(ExitCode::Usage, fmt::format("'{}' is not of the form name=value", word));
  }
  return {word.substr(0, equals), word.substr(equals + 1)};
}

[[noreturn]] void unknownName(const std::string& what, const std::string& name,
                              const std::vector<std::string>& known) {
  const auto near = nearest(name, known, 3);
  std::string hint;
  if (!near.empty()) {
    hint = fmt::format("; did you mean {}?", fmt::join(near, ", "));
  } else if (!known.empty()) {
    hint = fmt::format("; there are: {}", fmt::join(known, ", "));
  } else {
    hint = "; there are none";
  }
  throw CommandError(ExitCode::BadArgument, fmt::format("{} '{}'{}", what, name, hint));
}

}  // namespace

std::string signatureOf(const FeatureData& feature) {
  std::string type = typeName(feature.cmpiType);
  if (feature.cmpiType == CMPI_instance) {
    type = fmt::format("embedded {}", feature.refClass == nullptr ? "object" : feature.refClass);
  } else if (feature.refClass != nullptr) {
    type = fmt::format("{} {}", type, feature.refClass);
  }
  return fmt::format("{}{} {}", type, feature.isArray ? "[]" : "", feature.name);
}

Value parseValue(const FeatureData& feature, const std::string& text, const ClassCatalogue& classes,
                 const PathResolver& resolve) {
  return ValueReader(feature, classes, resolve).read(text);
}

NamedValues parseArguments(const ClassData& classData, const MethodData& method,
                           const std::vector<std::string>& words, const ClassCatalogue& classes,
                           const PathResolver& resolve) {
  std::vector<std::string> known;
  for (const FeatureData& parameter : parameters(method)) {
    if (parameter.isIn) {
      known.emplace_back(parameter.name);
    }
  }
  NamedValues arguments;
  for (const std::string& word : words) {
    const auto [name, text] = splitWord(word);
    const FeatureData* parameter = findParameter(method, name);
    if (parameter == nullptr || !parameter->isIn) {
      unknownName(fmt::format("{}.{} takes no", classData.name, method.name), name, known);
    }
    arguments.set(parameter->name, parseValue(*parameter, text, classes, resolve));
  }
  return arguments;
}

NamedValues parseProperties(const ClassData& classData, const std::vector<std::string>& words,
                            const ClassCatalogue& classes, const PathResolver& resolve) {
  NamedValues properties;
  for (const std::string& word : words) {
    const auto [name, text] = splitWord(word);
    const FeatureData* feature = findFeature(classData, name);
    if (feature == nullptr) {
      std::vector<std::string> known;
      for (const FeatureData& each : features(classData)) {
        known.emplace_back(each.name);
      }
      unknownName(fmt::format("{} has no property", classData.name), name, known);
    }
    properties.set(feature->name, parseValue(*feature, text, classes, resolve));
  }
  return properties;
}

}  // namespace tvx::host
