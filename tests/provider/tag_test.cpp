// Frame tagging through the built library, with the tagging library in the default scope.
#include <dlfcn.h>

#include <filesystem>
#include <fstream>
#include <sstream>
#include <string>
#include <thread>
#include <vector>

#include "Provider_Fixture.h"
#include "support/Loopback_Servers.h"
#include "support/System_Curl.h"
#include "support/Working_Folder.h"
#include "tvxsim/tvxsim.h"

namespace tvx::test {
namespace {

using host::Value;
using Texts = std::vector<std::string>;

class Tags : public Provider_Test {
 protected:
  static void SetUpTestSuite() {
    ASSERT_TRUE(keepSystemCurl());
    ASSERT_NE(::dlopen(TVX_SIM_TVSDM, RTLD_NOW | RTLD_GLOBAL), nullptr) << ::dlerror();
  }

  void SetUp() override {
    Provider_Test::SetUp();
    ::unsetenv("http_proxy");
    std::filesystem::create_directories(root / "dumps");
    std::filesystem::create_directories(root / "tmp");
    // Every line of the provider's log, in a file.
    writeFile("etc/torvex_fc_provider.dmp", "2,5,1\n" + (root / "trace.log").string());
    start(2);
  }

  /// A host of two ports, the first with so many tags.
  void start(int entries) {
    std::string list;
    for (int i = 0; i < entries; i++)
      list += std::string(i == 0 ? "" : ", ") +
              R"({"source": "10000000000000A1", "target": "50000000000000C1", "tag": )" +
              std::to_string(i % 250 + 1) + "}";
    useScenario(R"({"cards": [{"ports": [{"wwpn": "10000000000000A1", "dumps": {"directory": ")" +
                (root / "dumps").string() + R"("}, "qos": {"flag": 5, "entries": [)" + list +
                R"(]}}]}, {"ports": [{"wwpn": "10000000000000B1"}]}]})");
    load();
    service = instances("TVXHBA_FCTagService").at(0).path;
    target = instances("TVXHBA_FCPort").at(0).path;
  }

  std::uint64_t call(const std::string& method, host::NamedValues arguments = {}) {
    arguments.set("Target", Value::reference(target));
    reply = broker->invokeMethod(service, method, std::move(arguments));
    EXPECT_EQ(reply.status.rc, CMPI_RC_OK) << reply.status.message;
    EXPECT_FALSE(reply.report.leaks()) << reply.report.text();
    return reply.returnValue.isNull() ? 99999 : reply.returnValue.asUnsigned();
  }
  std::uint64_t getTable(const std::string& uri) {
    return call("GetConfigTable", {{"URI", Value::string(uri)}});
  }
  std::uint64_t setTable(const std::string& uri) {
    return call("SetConfigTable", {{"URI", Value::string(uri)}});
  }
  std::string read(const std::string& path) {
    std::ostringstream text;
    text << std::ifstream(root / path).rdbuf();
    return text.str();
  }
  bool logged(const std::string& level, const std::string& text) {
    return read("trace.log").find("][" + level + "] " + text + "\n") != std::string::npos;
  }

  Working_Folder folder;
  host::ObjectPath service;
  host::ObjectPath target;
  host::Reply reply;
};

TEST_F(Tags, FlagOfAnAdapterIsReadAndSet) {
  EXPECT_EQ(call("GetGlobalFlag"), 0u);
  EXPECT_EQ(reply.outputs.find("State")->asUnsigned(), 5u);
  EXPECT_EQ(call("SetGlobalFlag", {{"State", Value::number(CMPI_uint32, 4294967295u)}}), 0u);
  EXPECT_EQ(call("GetGlobalFlag"), 0u);
  EXPECT_EQ(reply.outputs.find("State")->asUnsigned(), 4294967295u);
  target = instances("TVXHBA_FCPort").at(1).path;
  EXPECT_EQ(call("GetGlobalFlag"), 0u);
  EXPECT_EQ(reply.outputs.find("State")->asUnsigned(), 0u) << "another adapter's";
}

TEST_F(Tags, TableGoesIntoAFileAndBack) {
  EXPECT_EQ(getTable("table.xml"), 0u);
  const std::string text = read("dumps/table.xml");
  EXPECT_EQ(text.find("<?xml version=\"1.0\" encoding=\"utf-8\"?>\n<ApexConfig>\n"), 0u);
  EXPECT_NE(text.find("<numberOfEntries>2</numberOfEntries>"), std::string::npos);
  EXPECT_EQ(setTable((root / "dumps/table.xml").string()), 0u);
  EXPECT_TRUE(std::filesystem::exists(root / "dumps/table.xml"));
  EXPECT_TRUE(logged("TVX_ERR", "TVXHBA_FCTagService_Provider::CPQFC_QoSSetConfig is success"));
  EXPECT_EQ(getTable("again.xml"), 0u);
  const auto rows = [](const std::string& document) {
    return document.substr(document.find("<Configuration>"));
  };
  EXPECT_EQ(rows(read("dumps/again.xml")), rows(text));
}

TEST_F(Tags, TableComesFromAServerAndItsCopyIsRemoved) {
  ASSERT_EQ(getTable("table.xml"), 0u);
  std::string text = read("dumps/table.xml");
  text.replace(text.find("<tag>2</tag>"), 12, "<tag>300</tag>");
  Http_Server server;
  server.put("new.xml", text);
  EXPECT_EQ(setTable(server.url("new.xml")), 0u);
  EXPECT_TRUE(logged("TVX_DBG", "TVXHBA_FCTagService_Provider::filename is : new.xml"));
  EXPECT_TRUE(logged("TVX_DBG",
                     "TVXHBA_FCTagService_Provider::: FC TAG Config file new.xml "
                     "removed successfully"));
  EXPECT_TRUE(folder.files().empty());
  EXPECT_EQ(getTable("again.xml"), 0u);
  EXPECT_NE(read("dumps/again.xml").find("<tag>44</tag>"), std::string::npos);
}

TEST_F(Tags, ACopyThatIsGoneIsTold) {
  ASSERT_EQ(getTable("table.xml"), 0u);
  Http_Server server;
  server.put("new.xml", read("dumps/table.xml"));
  addFault(R"({"call": "CPQFC_QoSSetConfig", "delay_ms": 60})");
  std::thread thief([this] {
    while (tvxsim_calls("CPQFC_QoSSetConfig", nullptr) == 0) std::this_thread::yield();
    std::filesystem::remove(folder.path("new.xml"));
  });
  EXPECT_EQ(setTable(server.url("new.xml")), 0u);
  thief.join();
  EXPECT_TRUE(logged("TVX_DBG", "TVXHBA_FCTagService_Provider:: Can't stat file new.xml"));
}

TEST_F(Tags, WhatAServerSendsInsteadOfATableShowsInTheLogAlone) {
  Http_Server server;
  server.put("bad.xml", "<ApexConfig/>");
  EXPECT_EQ(setTable(server.url("bad.xml")), 0u);
  EXPECT_TRUE(
      logged("TVX_DBG", "theSystemNode is not found or corrupted in the Apex config table"));
  EXPECT_TRUE(folder.files().empty());
  EXPECT_EQ(setTable("http://127.0.0.1:1/none.xml"), 7u) << "the transfer's own status stays";
  EXPECT_TRUE(folder.files().empty());
  EXPECT_EQ(getTable("table.xml"), 0u);
  EXPECT_NE(read("dumps/table.xml").find("<tag>2</tag>"), std::string::npos);
}

TEST_F(Tags, WrongArgumentsAreAnswered) {
  EXPECT_EQ(getTable(""), 4097u);
  EXPECT_EQ(setTable(""), 4097u);
  EXPECT_EQ(call("GetConfigTable"), 4097u);
  EXPECT_EQ(setTable("nosuchfile"), 4107u);
  EXPECT_EQ(setTable(std::string(5000, 'n')), 5u);
  for (const char* name : {"../t.xml", "/etc/t.xml", "a/../../t.xml"}) {
    EXPECT_EQ(getTable(name), 4097u) << name;
    EXPECT_TRUE(logged("TVX_ERR", "TVXHBA_FCTagService_Provider::GetConfigTable: '" +
                                      std::string(name) + "' leads out of the folder of the table"))
        << name;
  }
  EXPECT_TRUE(std::filesystem::is_empty(root / "dumps"));
  const host::ObjectPath port = target;
  target.keys.set("DeviceID", Value::string("10000000000000FF"));
  EXPECT_EQ(getTable("t.xml"), 32968u);
  target = port;
  service.keys.set("Name", Value::string("another"));
  EXPECT_EQ(getTable("t.xml"), 33068u);
}

TEST_F(Tags, AMissingTargetIsAnswered) {
  for (const char* method :
       {"GetGlobalFlag", "SetGlobalFlag", "GetConfigTable", "SetConfigTable"}) {
    reply = broker->invokeMethod(service, method, {});
    EXPECT_EQ(reply.status.rc, CMPI_RC_OK) << method;
    EXPECT_EQ(reply.returnValue.asUnsigned(), 4097u) << method;
  }
  // A path of another class does not fit the parameter, and counts as none.
  target = instances("TVXHBA_Card").at(0).path;
  EXPECT_EQ(call("GetGlobalFlag"), 4097u);
}

TEST_F(Tags, WithoutEntriesThereIsNoFile) {
  unload();
  start(0);
  EXPECT_EQ(getTable("table.xml"), 32767u);
  EXPECT_TRUE(std::filesystem::is_empty(root / "dumps"));
}

TEST_F(Tags, AThousandRowsGoIntoAFileAndBack) {
  unload();
  start(1000);
  EXPECT_EQ(getTable("table.xml"), 0u);
  EXPECT_EQ(setTable((root / "dumps/table.xml").string()), 0u);
  EXPECT_EQ(getTable("again.xml"), 0u);
  EXPECT_NE(read("dumps/again.xml").find("<numberOfEntries>1000</numberOfEntries>"),
            std::string::npos);
}

}  // namespace
}  // namespace tvx::test
