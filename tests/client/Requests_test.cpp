// Single requests of a client to classes of every kind.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "Raw_Client.h"
#include "Served_Program.h"
#include "Wbemcli.h"

namespace tvx::host::test {
namespace {

using ::testing::HasSubstr;
using ::testing::Not;
using ::testing::SizeIs;

class RequestsTest : public ::testing::Test {
 protected:
  std::string url(const std::string& rest) const { return "http://" + m_Server.host() + rest; }
  std::string firstName(const std::string& className,
                        const std::string& nameSpace = "/root/torvex:") const {
    const WbemcliAnswer names = wbemcli({"ein", url(nameSpace + className)});
    EXPECT_FALSE(names.lines.empty()) << className;
    return m_Texts.asInput(names.lines.at(0));
  }

  ServedProgram m_Server{{TVXCIM, "--sim"}};
  WbemcliTexts m_Texts{m_Server.host()};
};

TEST_F(RequestsTest, ASuperclassReachesItsSubclasses) {
  const WbemcliAnswer ports = wbemcli({"ein", url("/root/torvex:CIM_LogicalPort")});
  EXPECT_EQ(ports.exitCode, 0) << ports.text;
  EXPECT_THAT(ports.text, HasSubstr(":TVXHBA_FCPort.SystemCreationClassName=\""));
}

TEST_F(RequestsTest, APropertyListCutsWhatIsPrinted) {
  const WbemcliAnswer cut = wbemcli({"gi", firstName("TVXHBA_FCPort"), "PortType,MaxSpeed"});
  EXPECT_EQ(cut.exitCode, 0) << cut.text;
  EXPECT_THAT(cut.text, HasSubstr("PortType=10"));
  EXPECT_THAT(cut.text, Not(HasSubstr("PermanentAddress=")));
}

TEST_F(RequestsTest, OnePropertyIsRead) {
  const WbemcliAnswer type = wbemcli({"gp", firstName("TVXHBA_FCPort"), "PortType"});
  EXPECT_EQ(type.exitCode, 0);
  EXPECT_THAT(type.lines, ::testing::ElementsAre("10"));
}

TEST_F(RequestsTest, KeysWithBlanksAndColonsAreFound) {
  const std::string name =
      url("/root/pg_interop:TVXHBA_RegisteredProfile.InstanceID=\"TVX:Profile Registration\"");
  const WbemcliAnswer profile = wbemcli({"gi", name});
  EXPECT_EQ(profile.exitCode, 0) << profile.text;
  EXPECT_THAT(profile.text, HasSubstr("RegisteredName=\"Profile Registration\""));
  EXPECT_GE(wbemcli({"ain", name}).lines.size(), 1u);
}

TEST_F(RequestsTest, ARegisteredMethodRuns) {
  const WbemcliAnswer answer = wbemcli({"cm", firstName("TVXHBA_RecordLog"), "ClearLog"});
  EXPECT_EQ(answer.exitCode, 0) << answer.text;
  EXPECT_THAT(answer.text, HasSubstr("ClearLog: 0"));
}

TEST_F(RequestsTest, ArgumentsAreTypedByTheClass) {
  const WbemcliAnswer wide =
      wbemcli({"cm", firstName("TVXHBA_RecordLog"), "SetLogParams.LogLevel=70000"});
  EXPECT_THAT(wide.text, HasSubstr("(13) CIM_ERR_TYPE_MISMATCH"));
}

struct Failure {
  const char* name;
  std::vector<std::string> words;  ///< the place follows "@"
  const char* text;
};

class FailureTest : public RequestsTest, public ::testing::WithParamInterface<Failure> {};

TEST_P(FailureTest, IsToldByItsCimCode) {
  std::vector<std::string> words = GetParam().words;
  for (std::string& word : words) {
    word = word.starts_with('@') ? url(word.substr(1)) : word;
  }
  const WbemcliAnswer answer = wbemcli(words);
  EXPECT_NE(answer.exitCode, 0);
  EXPECT_THAT(answer.text, HasSubstr(GetParam().text));
}

const Failure failures[] = {
    {"Class", {"ein", "@/root/torvex:TVXHBA_None"}, "(5) CIM_ERR_INVALID_CLASS"},
    {"NameSpace", {"ein", "@/root/none:TVXHBA_Card"}, "(3) CIM_ERR_INVALID_NAMESPACE"},
    {"Instance",
     {"gi", "@/root/torvex:TVXHBA_Card.Tag=\"none\",CreationClassName=\"TVXHBA_Card\""},
     "(6) CIM_ERR_NOT_FOUND"},
    {"Key", {"gi", "@/root/torvex:TVXHBA_Card.Color=\"none\""}, "(4) CIM_ERR_INVALID_PARAMETER"},
    {"Method",
     {"cm", "@/root/torvex:TVXHBA_Card.Tag=\"x\",CreationClassName=\"TVXHBA_Card\"", "Fly.x=1"},
     "(17) CIM_ERR_METHOD_NOT_FOUND"},
    {"Property",
     {"gp", "@/root/torvex:TVXHBA_Card.Tag=\"x\",CreationClassName=\"TVXHBA_Card\"", "Wing"},
     "(12) CIM_ERR_NO_SUCH_PROPERTY"},
    {"ClassDescription", {"gc", "@/root/torvex:TVXHBA_None"}, "(5) CIM_ERR_INVALID_CLASS"}};

INSTANTIATE_TEST_SUITE_P(All, FailureTest, ::testing::ValuesIn(failures),
                         [](const auto& each) { return each.param.name; });

TEST_F(RequestsTest, WrongAndAbortedRequestsLeaveTheProviderServing) {
  for (const char* bytes : {"", "GET / HTTP/1.1\r\n\r\n", "POST /cimom HTTP/1.1\r\nContent-"}) {
    RawClient(m_Server.port()).send(bytes);
  }
  RawClient broken(m_Server.port());
  broken.send(requestHead(9) + "<CIM><A/>");
  EXPECT_THAT(broken.receive(), HasSubstr("CIMError: request-not-well-formed"));
  EXPECT_THAT(wbemcli({"ein", url("/root/torvex:TVXHBA_FCPort")}).lines, SizeIs(4));
}

/// The provider of the tests has a widget with quotes, blanks, a colon and a backslash in its key.
class QuotesTest : public ::testing::Test {
 protected:
  std::string url(const std::string& rest) const { return "http://" + m_Server.host() + rest; }

  ServedProgram m_Server{{TVXCIM_FAKE, "--strict", "--lib", FAKE_PROVIDER}};
};

TEST_F(QuotesTest, AreListedAndFoundAgain) {
  const WbemcliAnswer names = wbemcli({"ein", url("/root/fake:FAKE_Widget")});
  EXPECT_EQ(names.exitCode, 0) << names.text;
  EXPECT_THAT(names.text, HasSubstr(R"(Name="wid get: \"1\"\\",Number=1)"));
  // The client cannot take such a key back, so that the request is written out.
  const std::string body =
      operation("GetInstance", parameter("InstanceName", widgetName(oddName, 1)));
  RawClient client(m_Server.port());
  client.send(requestHead(body.size()) + body);
  EXPECT_THAT(client.receive(), HasSubstr(std::string("<VALUE>") + oddName + "</VALUE>"));
  EXPECT_EQ(m_Server.end(), 0) << "something leaked";
}

TEST_F(QuotesTest, InstancesAreMadeChangedAndDeleted) {
  const std::string widget = url("/root/fake:FAKE_Widget.Name=\"widget2\",Number=2");
  EXPECT_EQ(wbemcli({"sp", widget, "Color=\"green\""}).exitCode, 0);
  const WbemcliAnswer refused = wbemcli({"sp", widget, "Color=\"pink\""});
  EXPECT_THAT(refused.text, HasSubstr("only the color green can be set"));
  EXPECT_EQ(wbemcli({"di", widget}).exitCode, 0);
  const WbemcliAnswer made =
      wbemcli({"ci", url("/root/fake:FAKE_Widget.Name=\"my: new one\",Number=9"),
               "Name=\"my: new one\",Number=9"});
  EXPECT_EQ(made.exitCode, 0) << made.text;
  EXPECT_THAT(made.text, HasSubstr("my: new one"));
}

TEST_F(QuotesTest, AMethodGivesItsOutputs) {
  const WbemcliAnswer painted =
      wbemcli({"cm", url("/root/fake:FAKE_Widget.Name=\"widget0\",Number=0"),
               "Paint.Color=\"red\",Coats=3"});
  EXPECT_EQ(painted.exitCode, 0) << painted.text;
  EXPECT_THAT(painted.text, HasSubstr("Paint: "));
  EXPECT_THAT(painted.text, HasSubstr("Coats (uint16): 4"));
}

}  // namespace
}  // namespace tvx::host::test
