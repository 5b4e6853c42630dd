// Frame tagging in a process that does not have the tagging library.
#include <dlfcn.h>

#include <filesystem>

#include "Provider_Fixture.h"

namespace tvx::test {
namespace {

using host::Value;

TEST_F(Provider_Test, WithoutTheTaggingLibraryEveryMethodOfFrameTaggingFails) {
  ASSERT_EQ(::dlsym(RTLD_DEFAULT, "CPQFC_OpenAdapter"), nullptr);
  load();
  const host::ObjectPath service = instances("TVXHBA_FCTagService").at(0).path;
  const Value port = Value::reference(instances("TVXHBA_FCPort").at(0).path);
  writeFile("t.xml", "<ApexConfig/>");
  const auto call = [&](const char* method, host::NamedValues arguments) {
    arguments.set("Target", port);
    const host::Reply reply = broker->invokeMethod(service, method, std::move(arguments));
    EXPECT_EQ(reply.status.rc, CMPI_RC_OK) << method;
    EXPECT_FALSE(reply.report.leaks()) << method;
    return reply.returnValue.asUnsigned();
  };
  EXPECT_EQ(call("GetGlobalFlag", {}), 1u);
  EXPECT_EQ(call("SetGlobalFlag", {{"State", Value::number(CMPI_uint32, 1)}}), 1u);
  EXPECT_EQ(call("GetConfigTable", {{"URI", Value::string("t.xml")}}), 1u);
  // The document is looked at first, and a fault of it shows in the log alone.
  EXPECT_EQ(call("SetConfigTable", {{"URI", Value::string((root / "t.xml").string())}}), 0u);
  writeFile("t.xml",
            "<ApexConfig><theSystem><ApexVersion/><CreationDate/><HostName/><Adapter/></theSystem>"
            "<Configuration><numberOfEntries>0</numberOfEntries><Row/></Configuration>"
            "</ApexConfig>");
  EXPECT_EQ(call("SetConfigTable", {{"URI", Value::string((root / "t.xml").string())}}), 1u);
}

}  // namespace
}  // namespace tvx::test
