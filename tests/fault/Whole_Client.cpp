#include "Whole_Client.h"

#include "cli/Arguments.h"
#include "cli/ExitCode.h"

namespace tvx::test {

using host::ClassData;
using host::Instance;
using host::ObjectPath;
using host::Reply;
using host::Request;
using host::Value;

void Client_Tally::add(const Client_Tally& other) {
  requests += other.requests;
  instances += other.instances;
  methods += other.methods;
  for (const auto& [status, number] : other.byStatus) byStatus[status] += number;
  examples.insert(other.examples.begin(), other.examples.end());
  leaks.insert(leaks.end(), other.leaks.begin(), other.leaks.end());
  lost.insert(lost.end(), other.lost.begin(), other.lost.end());
}

Whole_Client::Whole_Client(host::Broker& broker, const host::ClassCatalogue& classes,
                           std::string folder)
    : m_Broker(broker), m_Classes(classes), m_Folder(std::move(folder)) {}

Reply Whole_Client::countWhole(Reply reply, const std::string& what) {
  if (reply.status.ok() && !reply.done) m_Tally.lost.push_back(what);
  return count(std::move(reply), what);
}

Reply Whole_Client::count(Reply reply, const std::string& what) {
  ++m_Tally.requests;
  if (++m_Tally.byStatus[reply.status.rc] == 1) m_Tally.examples[reply.status.rc] = what;
  m_Tally.instances += reply.instances.size();
  if (reply.report.leaks()) m_Tally.leaks.push_back(what + ": " + reply.report.text());
  return reply;
}

const ObjectPath* Whole_Client::readInstancesOf(const ClassData& classData) {
  const std::string name = classData.name;
  countWhole(m_Broker.enumerateInstanceNames(name), "names of " + name);
  const Reply all = countWhole(m_Broker.enumerateInstances(name), "instances of " + name);
  m_First.erase(name);
  if (all.instances.empty()) return nullptr;
  const ObjectPath& path = m_First[name] = all.instances.front().path;
  countWhole(m_Broker.getInstance(path), "instance of " + name);
  return &path;
}

void Whole_Client::readClass(const ClassData& classData) {
  const ObjectPath* first = readInstancesOf(classData);
  if (first == nullptr || classData.isAssociation) return;
  count(m_Broker.associatorNames(*first), std::string("neighbours of ") + classData.name);
}

void Whole_Client::readEverything() {
  for (const ClassData* each : m_Classes.all())
    if (each->isServed) readClass(*each);
}

void Whole_Client::readInstances() {
  for (const ClassData* each : m_Classes.all())
    if (each->isServed)
      countWhole(m_Broker.enumerateInstances(each->name),
                 std::string("instances of ") + each->name);
}

const ObjectPath* Whole_Client::firstOf(const std::string& className) {
  const auto found = m_First.find(className);
  return found == m_First.end() ? nullptr : &found->second;
}

void Whole_Client::callBare(const ClassData& classData) {
  const ObjectPath* first = firstOf(classData.name);
  ObjectPath path;
  path.className = classData.name;
  for (const host::MethodData& method : host::methods(classData)) {
    ++m_Tally.methods;
    count(m_Broker.invokeMethod(first ? *first : path, method.name),
          std::string(classData.name) + "." + method.name);
  }
}

void Whole_Client::call(const Method_Call& call) {
  const ClassData* classData = m_Classes.find(call.className);
  const host::MethodData* method = host::findMethod(*classData, call.method);
  const ObjectPath* object = firstOf(call.className);
  if (object == nullptr) return;  // a host that is in trouble shows no such service
  try {
    const auto arguments = host::parseArguments(
        *classData, *method, call.arguments, m_Classes, [this](const std::string& text) {
          const ObjectPath* first = firstOf(text.substr(1));
          if (first == nullptr) throw host::CommandError(host::ExitCode::NotFound, text);
          return *first;
        });
    ++m_Tally.methods;
    count(m_Broker.invokeMethod(*object, method->name, arguments),
          std::string(call.className) + "." + call.method);
  } catch (const host::CommandError&) {
    // The instance that the call is about is not there.
  }
}

void Whole_Client::runTests() {
  const auto controllers = m_Broker.enumerateInstances("TVXHBA_PortController").instances;
  if (controllers.empty()) return;
  for (const Instance& test : m_Broker.enumerateInstances("TVXHBA_FCHBADiagnosticTest").instances) {
    Instance settings;
    settings.path.className = "TVXHBA_FCHBADiagnosticSettingData";
    settings.properties.set("InstanceID", test.property("Name"));
    settings.properties.set("TargetDevice", Value::string("500C0FF12A001001"));
    settings.properties.set("LoopControlParameter",
                            Value::array(CMPI_string, {Value::string("2")}));
    // The last port may have a plug in place of a fabric.
    const bool wantsPlug = test.text("Name").find("External") != std::string::npos;
    const Instance& controller = wantsPlug ? controllers.back() : controllers.front();
    ++m_Tally.methods;
    count(m_Broker.invokeMethod(test.path, "RunDiagnosticService",
                                {{"ManagedElement", Value::reference(controller.path)},
                                 {"DiagnosticSettings", Value::embedded(std::move(settings))}}),
          test.text("Name"));
  }
}

void Whole_Client::callEverything() {
  runTests();  // first: later calls disable ports
  for (const ClassData* each : m_Classes.all())
    if (each->isServed) callBare(*each);
  for (const Method_Call& each : purposefulCalls(m_Folder)) call(each);
}

void Whole_Client::changeSettings() {
  ++m_Changes;
  const Reply all =
      countWhole(m_Broker.enumerateInstances("TVXHBA_ProviderConfigSetting"), "settings");
  for (Instance setting : all.instances) {
    const bool isMinutes = setting.path.key("InstanceID").asText().ends_with(":cachetimeout");
    setting.properties.set(
        "current", Value::number(CMPI_uint32, isMinutes ? m_Changes % 30 + 1 : m_Changes % 2));
    count(m_Broker.modifyInstance(setting, {{"current"}}), "change a setting");
  }
}

void Whole_Client::changeEverything() {
  changeSettings();
  for (const char* name : {"TVXHBA_FCPort", "TVXHBA_DriverParams", "TVXHBA_DriverParamGlobal",
                           "TVXHBA_DumpData", "TVXHBA_VirtualFCPort"}) {
    const ClassData* classData = m_Classes.find(name);
    const ObjectPath* first = firstOf(name);
    if (classData == nullptr || first == nullptr) continue;
    const Reply found = countWhole(m_Broker.getInstance(*first), std::string("get ") + name);
    if (found.instances.empty()) continue;
    Instance instance = found.instances.front();
    if (instance.has("RetentionCount"))
      instance.properties.set("RetentionCount", Value::number(CMPI_uint32, 3));
    count(m_Broker.modifyInstance(instance), std::string("modify ") + name);
    count(m_Broker.createInstance(instance), std::string("create ") + name);
    count(m_Broker.deleteInstance(*first), std::string("delete ") + name);
  }
}

}  // namespace tvx::test
