#include "cli/Output.h"

#include <fmt/format.h>

#include <algorithm>

#include "cim/JsonText.h"
#include "cli/Table.h"

namespace tvx::host {
namespace {

constexpr std::size_t cellLimit = 48;
constexpr std::size_t extraColumns = 4;

/// Keys that name the system and the class; they are the same in every row.
constexpr const char* commonKeys[] = {"SystemCreationClassName", "SystemName", "CreationClassName"};

/// Properties that tell most about an instance, the most telling first.
constexpr const char* tellingProperties[] = {
    "ElementName", "Name",      "RegisteredName", "RegisteredVersion",  "Model",
    "paramname",   "current",   "VersionString",  "StatusDescriptions", "EnabledState",
    "RecordData",  "JobStatus", "Status",         "InstanceID",         "Description"};

template <class Names>
bool contains(const Names& names, std::string_view name) {
  return std::any_of(std::begin(names), std::end(names),
                     [&](const auto& each) { return sameName(each, name); });
}

std::string cellText(const Value* value) {
  if (value == nullptr || value->isNull()) {
    return "";
  }
  return value->type() == CMPI_ref ? shortPath(value->asReference()) : value->display();
}

bool isEmptyEverywhere(const std::vector<Instance>& instances, const char* name) {
  return std::all_of(instances.begin(), instances.end(),
                     [&](const Instance& each) { return each.text(name).empty(); });
}

std::vector<std::string> chosenColumns(const std::vector<Instance>& instances) {
  std::vector<std::string> columns;
  for (const NamedValue& key : instances.front().path.keys) {
    if (!contains(commonKeys, key.name)) {
      columns.push_back(key.name);
    }
  }
  const std::size_t keyColumns = columns.size();
  for (const char* name : tellingProperties) {
    if (columns.size() < keyColumns + extraColumns && !contains(columns, name) &&
        !isEmptyEverywhere(instances, name)) {
      columns.emplace_back(name);
    }
  }
  for (const NamedValue& property : instances.front().properties) {
    if (columns.empty()) {
      columns.push_back(property.name);
    }
  }
  return columns;
}

const Value* valueOf(const Instance& instance, const std::string& name) {
  const Value* value = instance.properties.find(name);
  return value != nullptr ? value : instance.path.keys.find(name);
}

}  // namespace

nlohmann::ordered_json jsonHead(const std::string& command) {
  return {{"version", jsonVersion}, {"command", command}};
}

std::string mofValue(const Value& value) {
  if (value.isNull()) {
    return "NULL";
  }
  if (value.isArray()) {
    std::vector<std::string> parts;
    for (const Value& element : value.elements()) {
      parts.push_back(mofValue(element));
    }
    return fmt::format("{{{}}}", fmt::join(parts, ", "));
  }
  if (value.type() == CMPI_instance) {
    return mofText(value.asInstance());
  }
  const bool isText =
      value.type() == CMPI_string || value.type() == CMPI_dateTime || value.type() == CMPI_ref;
  return isText ? quotedText(value.display()) : value.display();
}

std::string mofText(const Instance& instance) {
  std::string text = fmt::format("instance of {} {{\n", instance.className());
  for (const NamedValue& property : instance.properties) {
    text += fmt::format("    {} = {};\n", property.name, mofValue(property.value));
  }
  return text + "};\n";
}

std::string shortPath(const ObjectPath& path) {
  ObjectPath result;
  result.className = path.className;
  for (const NamedValue& key : path.keys) {
    if (!contains(commonKeys, key.name)) {
      result.keys.set(key.name, key.value);
    }
  }
  if (result.keys.empty()) {
    result.keys = path.keys;
  }
  return printPath(result);
}

std::string instanceTable(const std::vector<Instance>& instances, const PropertyList& properties) {
  if (instances.empty()) {
    return "no instances\n";
  }
  const std::vector<std::string> columns = properties ? *properties : chosenColumns(instances);
  Table table(columns);
  for (const Instance& instance : instances) {
    std::vector<std::string> row;
    for (const std::string& column : columns) {
      const std::string cell = cellText(valueOf(instance, column));
      const bool whole = properties.has_value() || instance.path.keys.find(column) != nullptr;
      row.push_back(whole ? cell : shortened(cell, cellLimit));
    }
    table.add(std::move(row));
  }
  return table.text();
}

std::string instanceDetails(const Instance& instance) {
  Table table({"PROPERTY", "TYPE", "VALUE"});
  for (const NamedValue& property : instance.properties) {
    const Value& value = property.value;
    const bool nested = !value.isNull() && value.type() == CMPI_instance;
    table.add({property.name, typeName(value.type()),
               value.isNull() ? "NULL"
               : nested       ? toJson(value.asInstance()).dump()
                              : value.display()});
  }
  return printPath(instance.path) + "\n" + table.text();
}

}  // namespace tvx::host
