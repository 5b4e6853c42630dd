// Whole hosts: every class that is served, with every instance and its values, against a committed
// text. After a wanted change, run this test with TVX_GOLDEN_UPDATE=1 and look at the difference.
#include <algorithm>
#include <cstdlib>
#include <fstream>
#include <sstream>

#include "Provider_Fixture.h"
#include "tvxsim/tvxsim.h"

namespace tvx::test {
namespace {

/// Values that differ from one machine, folder or moment to the next.
struct Mask {
  std::string root;  ///< the test's own folder
  std::string host;  ///< name of the machine

  void replace(std::string& text, const std::string& part, const char* mask) const {
    if (part.empty()) return;
    for (std::size_t at = 0; (at = text.find(part, at)) != std::string::npos;)
      text.replace(at, part.size(), mask);
  }
  std::string operator()(std::string text) const {
    replace(text, root, "<root>");
    // The name is short on some machines: it is masked where it stands alone or behind a colon.
    if (text == host) return "<host>";
    const std::string behind = ":" + host;
    if (text.size() > behind.size() && text.ends_with(behind))
      text.replace(text.size() - host.size(), host.size(), "<host>");
    return text;
  }
};

std::string printValue(const host::Value& value, const Mask& mask);

std::string printPath(const host::ObjectPath& path, const Mask& mask) {
  std::vector<std::string> keys;
  for (const host::NamedValue& key : path.keys)
    keys.push_back(key.name + "=" + printValue(key.value, mask));
  std::sort(keys.begin(), keys.end());
  std::string text = path.nameSpace + ":" + path.className;
  for (std::size_t i = 0; i < keys.size(); i++) text += (i == 0 ? "." : ",") + keys[i];
  return text;
}

std::string printValue(const host::Value& value, const Mask& mask) {
  if (value.isNull()) return "null";
  if (value.isArray()) {
    std::string text = "{";
    for (const host::Value& element : value.elements())
      text += (text.size() == 1 ? "" : ", ") + printValue(element, mask);
    return text + "}";
  }
  switch (value.type()) {
    case CMPI_ref:
      return "<" + printPath(value.asReference(), mask) + ">";
    case CMPI_string:
      return "\"" + mask(value.hasText() ? value.asText() : std::string()) + "\"";
    default:
      return value.display();
  }
}

/// Properties whose values come from the clock or from what the machine has installed.
std::string printProperty(const host::NamedValue& property, const Mask& mask) {
  for (const char* name : {"InstallDate", "ReleaseDate", "StatisticTime", "SupportedURISchemes"})
    if (property.name == name) return "(of the machine)";
  return printValue(property.value, mask);
}

std::vector<std::string> printInstance(const host::Instance& instance, const Mask& mask) {
  std::vector<std::string> lines = {printPath(instance.path, mask)};
  std::vector<std::string> properties;
  for (const host::NamedValue& property : instance.properties)
    if (!property.value.isNull())
      properties.push_back("    " + property.name + " = " + printProperty(property, mask));
  std::sort(properties.begin(), properties.end());
  lines.insert(lines.end(), properties.begin(), properties.end());
  return lines;
}

std::vector<std::string> linesOf(const std::filesystem::path& file) {
  std::vector<std::string> lines;
  std::ifstream stream(file);
  for (std::string line; std::getline(stream, line);) lines.push_back(line);
  return lines;
}

struct Golden_Host {
  const char* name;
  const char* scenario;  ///< file below the simulator's scenarios
  const char* foreign;   ///< instances of another provider; null: none
};

constexpr const char* PLATFORM = R"({"version": 1, "instances": [
  {"namespace": "root/ibmse", "class": "IBMSD_ComputerSystem", "properties": {
    "CreationClassName": "IBMSD_ComputerSystem", "Name": "platform-host"}},
  {"namespace": "root/ibmse", "class": "IBMSD_Chassis", "properties": {
    "CreationClassName": "IBMSD_Chassis", "Tag": "platform-chassis"}}]})";

constexpr Golden_Host HOSTS[] = {
    {"no_adapter", "none.json", nullptr},   {"single_port", "single.json", nullptr},
    {"dual_port", "default.json", nullptr}, {"e200", "e200.json", nullptr},
    {"faulty", "faulty.json", nullptr},     {"platform", "single.json", PLATFORM},
};

class Golden : public Provider_Test, public ::testing::WithParamInterface<Golden_Host> {
 protected:
  /// The machine's name, from whatever of the host tells it.
  std::string machineName() {
    const std::string start = "TVXHBA:ProviderLog:";
    for (const host::Instance& log : instances("TVXHBA_RecordLog"))
      if (const std::string id = log.text("InstanceID"); id.starts_with(start))
        return id.substr(start.size());
    for (const host::Instance& service : instances("TVXHBA_SoftwareInstallationService"))
      return service.text("SystemName");
    return {};
  }

  std::vector<std::string> printHost() {
    const Mask mask{root.string(), machineName()};
    std::vector<std::string> lines;
    for (const std::string& name : servedClasses()) {
      const std::vector<host::Instance> found = instances(name);
      lines.push_back(name + ": " + std::to_string(found.size()));
      for (const host::Instance& instance : found)
        for (const std::string& line : printInstance(instance, mask)) lines.push_back("  " + line);
    }
    return lines;
  }
};

TEST_P(Golden, HostIsAsCommitted) {
  std::ifstream scenario(std::string(TVX_SCENARIOS) + "/" + GetParam().scenario);
  std::ostringstream json;
  json << scenario.rdbuf();
  useScenario(json.str());
  tvxsim_hold_clock(1);  // the counters stand where they start
  load();
  if (GetParam().foreign) broker->addForeign(GetParam().foreign);
  instances("TVXHBA_SCSIProtocolEndpoint");  // waits for the SAN, which adds to the chips
  const std::vector<std::string> lines = printHost();
  const std::filesystem::path file =
      std::filesystem::path(TVX_GOLDEN) / (std::string(GetParam().name) + ".txt");
  if (std::getenv("TVX_GOLDEN_UPDATE")) {
    std::ofstream out(file);
    for (const std::string& line : lines) out << line << "\n";
  }
  const std::vector<std::string> wanted = linesOf(file);
  ASSERT_FALSE(wanted.empty()) << "no golden text " << file;
  for (std::size_t i = 0; i < std::min(lines.size(), wanted.size()); i++)
    ASSERT_EQ(lines[i], wanted[i]) << "line " << i + 1 << " of " << file;
  EXPECT_EQ(lines.size(), wanted.size());
}

INSTANTIATE_TEST_SUITE_P(Hosts, Golden, ::testing::ValuesIn(HOSTS),
                         [](const auto& tested) { return std::string(tested.param.name); });

}  // namespace
}  // namespace tvx::test
