#include "cli/Describe.h"

#include <fmt/format.h>

#include "cli/Arguments.h"
#include "cli/ExitCode.h"
#include "cli/Output.h"
#include "cli/Session.h"
#include "cli/Table.h"

namespace tvx::host {
namespace {

using Json = nlohmann::ordered_json;

const char* kindOf(const ClassData& classData) {
  return classData.isAggregation   ? "aggregation"
         : classData.isAssociation ? "association"
         : classData.isIndication  ? "indication"
                                   : "instance";
}

std::string orEmpty(const char* text) {
  return text == nullptr ? "" : text;
}

Json orNull(const char* text) {
  return text == nullptr ? Json() : Json(text);
}

std::vector<std::string> keysOf(const ClassData& classData) {
  std::vector<std::string> names;
  for (const FeatureData& feature : features(classData)) {
    if (feature.isKey) {
      names.emplace_back(feature.name);
    }
  }
  return names;
}

std::string typeOf(const FeatureData& feature) {
  const std::string signature = signatureOf(feature);
  return signature.substr(0, signature.rfind(' '));
}

std::string marks(const FeatureData& feature) {
  return std::string(feature.isKey ? "key" : "") +
         (feature.isKey && feature.isWritable ? ", " : "") + (feature.isWritable ? "writable" : "");
}

Json featureJson(const FeatureData& feature) {
  return {{"name", feature.name},
          {"type", typeOf(feature)},
          {"key", feature.isKey},
          {"writable", feature.isWritable},
          {"default", orNull(feature.defaultText)},
          {"origin", orNull(feature.originClass)}};
}

Json methodJson(const MethodData& method) {
  Json list = Json::array();
  for (const FeatureData& parameter : parameters(method)) {
    list.push_back({{"name", parameter.name},
                    {"type", typeOf(parameter)},
                    {"in", parameter.isIn},
                    {"out", parameter.isOut}});
  }
  return {{"name", method.name},
          {"returns", typeName(method.returnType)},
          {"origin", orNull(method.originClass)},
          {"parameters", list}};
}

Json classJson(const ClassData& classData) {
  return {{"name", classData.name},       {"superclass", orNull(classData.superName)},
          {"kind", kindOf(classData)},    {"abstract", classData.isAbstract},
          {"served", classData.isServed}, {"namespace", orNull(classData.nameSpace)},
          {"keys", keysOf(classData)}};
}

std::string ancestry(const ClassData& classData, const ClassCatalogue& classes) {
  std::string text = classData.name;
  for (const ClassData* each = &classData; each != nullptr && each->superName != nullptr;
       each = classes.find(each->superName)) {
    text += std::string(" : ") + each->superName;
  }
  return text;
}

void printFeatures(const ClassData& classData, std::ostream& out) {
  Table table({"PROPERTY", "TYPE", "MARKS", "DEFAULT", "FROM"});
  for (const FeatureData& feature : features(classData)) {
    table.add({feature.name, typeOf(feature), marks(feature), orEmpty(feature.defaultText),
               orEmpty(feature.originClass)});
  }
  out << table.text();
}

}  // namespace

std::string methodSignature(const MethodData& method) {
  std::vector<std::string> list;
  for (const FeatureData& parameter : parameters(method)) {
    const char* way = parameter.isIn && parameter.isOut ? "in out" : parameter.isOut ? "out" : "in";
    list.push_back(fmt::format("{} {}", way, signatureOf(parameter)));
  }
  return fmt::format("{} {}({})", typeName(method.returnType), method.name, fmt::join(list, ", "));
}

void describeClasses(const Options& options, const ClassCatalogue& classes, std::ostream& out) {
  Json list = Json::array();
  Table table({"CLASS", "KIND", "SUPERCLASS", "KEYS"});
  std::string methodLines;
  for (const ClassData* each : classes.all()) {
    if (!each->isServed && !options.allClasses) {
      continue;
    }
    Json json = classJson(*each);
    table.add({each->name, kindOf(*each), orEmpty(each->superName),
               shortened(fmt::format("{}", fmt::join(keysOf(*each), ",")), 80)});
    if (options.withMethods) {
      json["methods"] = Json::array();
      for (const MethodData& method : methods(*each)) {
        json["methods"].push_back(methodJson(method));
        methodLines += fmt::format("{}: {}\n", each->name, methodSignature(method));
      }
    }
    list.push_back(std::move(json));
  }
  if (options.format == Format::Json) {
    Json json = jsonHead("classes");
    json["classes"] = std::move(list);
    out << json.dump(2) << "\n";
    return;
  }
  out << table.text() << (methodLines.empty() ? "" : "\n") << methodLines
      << fmt::format("{} classes\n", table.rows());
}

void describeClass(const Options& options, const ClassCatalogue& classes, std::ostream& out) {
  const ClassData* classData = classes.find(options.className);
  if (classData == nullptr) {
    throw CommandError(ExitCode::UnknownClass, unknownClassText(classes, options.className),
                       CMPI_RC_ERR_INVALID_CLASS);
  }
  if (options.format == Format::Json) {
    Json json = jsonHead("class");
    json["class"] = classJson(*classData);
    json["class"]["properties"] = Json::array();
    for (const FeatureData& feature : features(*classData)) {
      json["class"]["properties"].push_back(featureJson(feature));
    }
    json["class"]["methods"] = Json::array();
    for (const MethodData& method : methods(*classData)) {
      json["class"]["methods"].push_back(methodJson(method));
    }
    out << json.dump(2) << "\n";
    return;
  }
  out << ancestry(*classData, classes) << "\n";
  out << kindOf(*classData) << (classData->isAbstract ? ", abstract" : "")
      << (classData->nameSpace == nullptr ? std::string(", not served")
                                          : std::string(", in ") + classData->nameSpace)
      << "\n\n";
  printFeatures(*classData, out);
  if (classData->methodCount != 0) {
    out << "\n";
  }
  for (const MethodData& method : methods(*classData)) {
    out << methodSignature(method) << "\n";
  }
}

}  // namespace tvx::host
