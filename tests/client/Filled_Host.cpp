#include "Filled_Host.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <fstream>
#include <nlohmann/json.hpp>

#include "Raw_Client.h"
#include "Wbemcli.h"

namespace tvx::host::test {
namespace {

using nlohmann::json;
using ::testing::HasSubstr;

constexpr const char* port = "10000254560C4110";
constexpr const char* baseServer = R"({"version": 1, "instances": [
  {"namespace": "root/pg_interop", "class": "PG_RegisteredProfile", "properties": {
    "InstanceID": "base", "RegisteredName": "Base Server", "RegisteredVersion": "1.0.1",
    "RegisteredOrganization": 2}}]})";

json scenario(const char* name) {
  std::ifstream file(std::string(TVX_SCENARIOS) + "/" + name);
  return json::parse(file);
}

/// Everything, and a card that sees units of every type.
std::string wholeScenario() {
  json whole = scenario("everything.json");
  const json types = scenario("san-types.json");
  json& cards = whole.at("cards");
  cards.insert(cards.end(), types.at("cards").begin(), types.at("cards").end());
  return whole.dump();
}

std::string binding(const std::string& key, const std::string& value) {
  return "<KEYBINDING NAME=\"" + key + "\"><KEYVALUE VALUETYPE=\"string\">" + value +
         "</KEYVALUE></KEYBINDING>";
}

std::string deviceName(const std::string& className, const std::string& system,
                       const std::string& lastKey) {
  return "<INSTANCENAME CLASSNAME=\"" + className + "\">" +
         binding("SystemCreationClassName", "CIM_ComputerSystem") + binding("SystemName", system) +
         binding("CreationClassName", className) + lastKey + "</INSTANCENAME>";
}

}  // namespace

FilledHost::FilledHost() {
  std::string pattern = testing::TempDir() + "tvx-filled-XXXXXX";
  m_Folder = mkdtemp(pattern.data());
  writeFiles();
  m_Server = std::make_unique<ServedProgram>(std::vector<std::string>{
      TVXCIM, "--strict", "--sim=" + (m_Folder / "whole.json").string(), "--root",
      (m_Folder / "root").string(), "--foreign", (m_Folder / "foreign.json").string()});
  if (m_Server->port() != 0) {
    fill();
  }
}

FilledHost::~FilledHost() {
  m_Server.reset();
  std::filesystem::remove_all(m_Folder);
}

void FilledHost::writeFiles() const {
  const auto write = [this](const char* name, const std::string& text) {
    std::filesystem::create_directories((m_Folder / name).parent_path());
    std::ofstream(m_Folder / name, std::ios::binary) << text;
  };
  write("whole.json", wholeScenario());
  write("foreign.json", baseServer);
  write("root/etc/tvx_smis.conf", "https://manager:8443/launch\n");
  write("root/etc/torvex_fc_provider.dmp", "4,3,1\n/var/log/provider.log\n");
  write("root/var/log/messages", "kernel: tvfc 0: link up\n");
}

void FilledHost::fill() const {
  const std::string url = "http://" + host() + "/root/torvex:";
  const WbemcliAnswer names = wbemcli({"ein", url + "TVXHBA_PortController"});
  ASSERT_FALSE(names.lines.empty()) << names.text;
  const std::string start = "SystemName=\"";
  const std::size_t from = names.text.find(start) + start.size();
  const std::string system = names.text.substr(from, names.text.find('"', from) - from);
  runDiagnostic(system);

  const WbemcliAnswer enabled = wbemcli(
      {"cm", url + "TVXHBA_RecordLog.InstanceID=\"TVX: FC Driver Record Log:" + system + "\"",
       "RequestStateChange.RequestedState=2"});
  EXPECT_THAT(enabled.text, HasSubstr("RequestStateChange: 0"));

  const std::string unit =
      std::string("InstanceID=\"TVX:OAS:Driver:") + port + ":500C0FF12A001001:3\"";
  const WbemcliAnswer marked = wbemcli({"ci", url + "TVXHBA_DriverParams." + unit, unit});
  EXPECT_EQ(marked.exitCode, 0) << marked.text;
}

/// The client cannot write a reference among the arguments of a method.
void FilledHost::runDiagnostic(const std::string& system) const {
  const std::string place =
      "<LOCALNAMESPACEPATH><NAMESPACE NAME=\"root\"/><NAMESPACE NAME=\"torvex\"/>"
      "</LOCALNAMESPACEPATH>";
  const std::string body = frame(
      "<METHODCALL NAME=\"RunDiagnosticService\"><LOCALINSTANCEPATH>" + place +
      deviceName("TVXHBA_FCHBADiagnosticTest", system,
                 binding("Name", "TVX:FCHBA Internal Loopback Test")) +
      "</LOCALINSTANCEPATH><PARAMVALUE NAME=\"ManagedElement\"><VALUE.REFERENCE>" +
      deviceName("TVXHBA_PortController", system, binding("DeviceID", port)) +
      "</VALUE.REFERENCE></PARAMVALUE><PARAMVALUE NAME=\"DiagnosticSettings\"><VALUE><![CDATA["
      "<INSTANCE CLASSNAME=\"TVXHBA_FCHBADiagnosticSettingData\">"
      "<PROPERTY NAME=\"InstanceID\" TYPE=\"string\"><VALUE>TVX:FCHBA Internal Loopback "
      "Test</VALUE></PROPERTY>"
      "<PROPERTY NAME=\"HaltOnError\" TYPE=\"boolean\"><VALUE>TRUE</VALUE></PROPERTY>"
      "</INSTANCE>]]></VALUE></PARAMVALUE></METHODCALL>");
  RawClient client(m_Server->port());
  client.send(requestHead(body.size()) + body);
  EXPECT_THAT(client.receive(), HasSubstr("<RETURNVALUE PARAMTYPE=\"uint32\"><VALUE>0</VALUE>"));
}

}  // namespace tvx::host::test
