// Messages through the CIM server into the fake provider.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <pugixml.hpp>

#include "Fake_Broker.h"
#include "Raw_Client.h"
#include "Test_Classes.h"
#include "http/CimErrors.h"
#include "http/CimServer.h"

namespace tvx::host::http {
namespace {

using test::classParameter;
using test::frame;
using test::oddName;
using test::operation;
using test::parameter;
using test::valueParameter;
using test::widgetName;
using ::testing::HasSubstr;
using ::testing::Not;

class CimServerTest : public ::testing::Test {
 protected:
  /// The answer, which has to be XML.
  std::string ask(const std::string& body) {
    const std::string answer = m_Server.answer(CimMessage(body), "here:1");
    pugi::xml_document document;
    EXPECT_TRUE(document.load_string(answer.c_str())) << answer;
    return answer;
  }
  std::string ask(const char* name, const std::string& parameters) {
    return ask(operation(name, parameters));
  }
  std::string call(const std::string& method, const std::string& parameters,
                   const std::string& target = widgetName("widget0", 0)) {
    return ask(frame("<METHODCALL NAME=\"" + method +
                     "\"><LOCALINSTANCEPATH><LOCALNAMESPACEPATH><NAMESPACE NAME=\"root\"/>"
                     "<NAMESPACE NAME=\"fake\"/></LOCALNAMESPACEPATH>" +
                     target + "</LOCALINSTANCEPATH>" + parameters + "</METHODCALL>"));
  }
  static std::string argument(const std::string& name, const std::string& content) {
    return "<PARAMVALUE NAME=\"" + name + "\">" + content + "</PARAMVALUE>";
  }

  test::FakeBroker m_Broker;
  CimServer m_Server{m_Broker, test::testClasses()};
};

TEST_F(CimServerTest, InstancesComeWithNamesTypesAndArrays) {
  const std::string answer = ask("EnumerateInstances", classParameter("FAKE_Widget"));
  EXPECT_THAT(answer, HasSubstr("<MESSAGE ID=\"7\" PROTOCOLVERSION=\"1.0\"><SIMPLERSP>"
                                "<IMETHODRESPONSE NAME=\"EnumerateInstances\"><IRETURNVALUE>"
                                "<VALUE.NAMEDINSTANCE><INSTANCENAME CLASSNAME=\"FAKE_Gadget\">"));
  EXPECT_THAT(answer, HasSubstr("<PROPERTY NAME=\"Number\" TYPE=\"uint32\"><VALUE>2</VALUE>"));
  EXPECT_THAT(answer, HasSubstr("<PROPERTY.ARRAY NAME=\"Sizes\" TYPE=\"uint16\"><VALUE.ARRAY>"
                                "<VALUE>10</VALUE><VALUE>20</VALUE></VALUE.ARRAY>"));
  EXPECT_THAT(answer, HasSubstr("<KEYVALUE VALUETYPE=\"numeric\" TYPE=\"uint32\">2</KEYVALUE>"));
}

TEST_F(CimServerTest, KeysWithQuotesBlanksAndColonsGoBothWays) {
  const std::string names = ask("EnumerateInstanceNames", classParameter("FAKE_Widget"));
  EXPECT_THAT(names, HasSubstr(std::string("\"string\" TYPE=\"string\">") + oddName + "<"));
  const std::string found = ask("GetInstance", parameter("InstanceName", widgetName(oddName, 1)));
  EXPECT_THAT(found, HasSubstr(std::string("<VALUE>") + oddName + "</VALUE>"));
}

TEST_F(CimServerTest, ASubclassIsReachedThroughItsSuperclassAndCutToIt) {
  const std::string deep = ask("EnumerateInstances", classParameter("CIM_Thing"));
  EXPECT_THAT(deep, HasSubstr("CLASSNAME=\"FAKE_Gadget\""));
  EXPECT_THAT(deep, HasSubstr("NAME=\"Color\""));
  const std::string flat =
      ask("EnumerateInstances",
          classParameter("CIM_Thing") + valueParameter("DeepInheritance", "FALSE"));
  EXPECT_THAT(flat, HasSubstr("CLASSNAME=\"FAKE_Gadget\""));
  EXPECT_THAT(flat, Not(HasSubstr("NAME=\"Color\"")));
}

TEST_F(CimServerTest, APropertyListCutsAndAnEmptyOneLeavesNone) {
  const std::string name = parameter("InstanceName", widgetName("widget2", 2));
  const std::string one =
      ask("GetInstance",
          name + parameter("PropertyList", "<VALUE.ARRAY><VALUE>color</VALUE></VALUE.ARRAY>"));
  EXPECT_THAT(one, HasSubstr("NAME=\"Color\""));
  EXPECT_THAT(one, Not(HasSubstr("NAME=\"Sizes\"")));
  const std::string none =
      ask("GetInstance", name + parameter("PropertyList", "<VALUE.ARRAY></VALUE.ARRAY>"));
  EXPECT_THAT(none, HasSubstr("<INSTANCE CLASSNAME=\"FAKE_Widget\"></INSTANCE>"));
}

TEST_F(CimServerTest, ClassOriginIsToldOnDemand) {
  const std::string name = parameter("InstanceName", widgetName("widget2", 2));
  EXPECT_THAT(ask("GetInstance", name), Not(HasSubstr("CLASSORIGIN")));
  EXPECT_THAT(ask("GetInstance", name + valueParameter("IncludeClassOrigin", "true")),
              HasSubstr("TYPE=\"string\" CLASSORIGIN=\"FAKE_Widget\""));
}

TEST_F(CimServerTest, AMissingInstanceClassAndNameSpaceAreTold) {
  EXPECT_THAT(ask("GetInstance", parameter("InstanceName", widgetName("nobody", 0))),
              HasSubstr("<ERROR CODE=\"6\" DESCRIPTION=\"no such widget\"/>"));
  EXPECT_THAT(ask("EnumerateInstances", classParameter("FAKE_None")),
              HasSubstr("<ERROR CODE=\"5\" DESCRIPTION=\"no class 'FAKE_None'\"/>"));
  EXPECT_THAT(ask(frame("<IMETHODCALL NAME=\"EnumerateInstances\"><LOCALNAMESPACEPATH>"
                        "<NAMESPACE NAME=\"nowhere\"/></LOCALNAMESPACEPATH>" +
                        classParameter("FAKE_Widget") + "</IMETHODCALL>")),
              HasSubstr("<ERROR CODE=\"3\" DESCRIPTION=\"no namespace 'nowhere' here\"/>"));
}

TEST_F(CimServerTest, InstancesAreMadeChangedAndDeleted) {
  const auto newInstance = [](const char* name) {
    return parameter("NewInstance",
                     std::string("<INSTANCE CLASSNAME=\"FAKE_Widget\"><PROPERTY NAME=\"Name\" "
                                 "TYPE=\"string\"><VALUE>") +
                         name + "</VALUE></PROPERTY></INSTANCE>");
  };
  EXPECT_THAT(ask("CreateInstance", newInstance("a &lt;b&gt;")),
              HasSubstr("<IRETURNVALUE><INSTANCENAME CLASSNAME=\"FAKE_Widget\"><KEYBINDING "
                        "NAME=\"Name\"><KEYVALUE VALUETYPE=\"string\" TYPE=\"string\">"
                        "a &lt;b&gt;</KEYVALUE>"));
  EXPECT_THAT(ask("CreateInstance", newInstance("widget0")), HasSubstr("<ERROR CODE=\"11\""));

  const auto modified = [](const char* color) {
    return parameter("ModifiedInstance",
                     "<VALUE.NAMEDINSTANCE>" + widgetName("widget0", 0) +
                         "<INSTANCE CLASSNAME=\"FAKE_Widget\"><PROPERTY NAME=\"Color\" "
                         "TYPE=\"string\"><VALUE>" +
                         color + "</VALUE></PROPERTY></INSTANCE></VALUE.NAMEDINSTANCE>");
  };
  const std::string colorOnly =
      parameter("PropertyList", "<VALUE.ARRAY><VALUE>Color</VALUE></VALUE.ARRAY>");
  EXPECT_THAT(ask("ModifyInstance", modified("green") + colorOnly),
              HasSubstr("<IMETHODRESPONSE NAME=\"ModifyInstance\"></IMETHODRESPONSE>"));
  EXPECT_THAT(ask("ModifyInstance", modified("pink") + colorOnly),
              HasSubstr("<ERROR CODE=\"4\" DESCRIPTION=\"only the color green can be set\"/>"));

  EXPECT_THAT(ask("DeleteInstance", parameter("InstanceName", widgetName("widget1x", 0))),
              HasSubstr("<ERROR CODE=\"6\""));
  EXPECT_THAT(ask("DeleteInstance", parameter("InstanceName", widgetName("widget2", 2))),
              HasSubstr("<IMETHODRESPONSE NAME=\"DeleteInstance\"></IMETHODRESPONSE>"));
}

TEST_F(CimServerTest, OnePropertyIsReadAndSet) {
  const std::string name = parameter("InstanceName", widgetName("widget2", 2));
  EXPECT_THAT(ask("GetProperty", name + valueParameter("PropertyName", "sizes")),
              HasSubstr("<IRETURNVALUE><VALUE.ARRAY><VALUE>10</VALUE><VALUE>20</VALUE>"));
  EXPECT_THAT(ask("GetProperty", name + valueParameter("PropertyName", "Weight")),
              HasSubstr("<ERROR CODE=\"12\" DESCRIPTION=\"class FAKE_Widget has no property "
                        "'Weight'\"/>"));
  const std::string set = name + valueParameter("PropertyName", "Color");
  EXPECT_THAT(ask("SetProperty", set + valueParameter("NewValue", "green")),
              HasSubstr("<IMETHODRESPONSE NAME=\"SetProperty\"></IMETHODRESPONSE>"));
  EXPECT_THAT(ask("SetProperty", set), HasSubstr("<ERROR CODE=\"4\""));
}

TEST_F(CimServerTest, AssociationsAreWalkedBothWays) {
  const std::string source = parameter("ObjectName", widgetName(oddName, 1));
  const std::string names = ask("AssociatorNames", source);
  EXPECT_THAT(names, HasSubstr(std::string("<OBJECTPATH><INSTANCEPATH><NAMESPACEPATH><HOST>here:1"
                                           "</HOST><LOCALNAMESPACEPATH><NAMESPACE NAME=\"root\"/>"
                                           "<NAMESPACE NAME=\"fake\"/></LOCALNAMESPACEPATH>")));
  EXPECT_THAT(names, HasSubstr(">widget0<"));
  EXPECT_THAT(names, HasSubstr(">widget2<"));
  EXPECT_THAT(ask("Associators", source + valueParameter("Role", "Antecedent")),
              ::testing::AllOf(HasSubstr("<VALUE>widget2</VALUE>"), Not(HasSubstr("widget0"))));
  EXPECT_THAT(
      ask("References", source + parameter("ResultClass", "<CLASSNAME NAME=\"FAKE_Link\"/>")),
      HasSubstr("<PROPERTY.REFERENCE NAME=\"Antecedent\" REFERENCECLASS=\"FAKE_Widget\">"
                "<VALUE.REFERENCE><INSTANCEPATH>"));
  EXPECT_THAT(ask("ReferenceNames", source),
              HasSubstr("<KEYBINDING NAME=\"Dependent\"><VALUE.REFERENCE>"));
  EXPECT_THAT(ask("ReferenceNames", parameter("ObjectName", "<CLASSNAME NAME=\"FAKE_Widget\"/>")),
              HasSubstr("<ERROR CODE=\"7\""));
}

TEST_F(CimServerTest, ClassesAreToldWithKeysDefaultsAndMethods) {
  const std::string whole =
      ask("GetClass", classParameter("fake_widget") + valueParameter("LocalOnly", "false"));
  EXPECT_THAT(whole, HasSubstr("<CLASS NAME=\"FAKE_Widget\" SUPERCLASS=\"CIM_Thing\">"));
  EXPECT_THAT(whole, HasSubstr("<PROPERTY NAME=\"Name\" TYPE=\"string\" PROPAGATED=\"false\">"
                               "<QUALIFIER NAME=\"Key\" TYPE=\"boolean\"><VALUE>true</VALUE>"));
  EXPECT_THAT(whole, HasSubstr("<VALUE>red</VALUE></PROPERTY>"));
  EXPECT_THAT(whole, HasSubstr("<METHOD NAME=\"Paint\" TYPE=\"uint32\""));
  EXPECT_THAT(whole, HasSubstr("<PARAMETER.REFARRAY NAME=\"Targets\" REFERENCECLASS="));
  EXPECT_THAT(whole, HasSubstr("NAME=\"Caption\""));
  const std::string own =
      ask("GetClass", classParameter("FAKE_Widget") + valueParameter("IncludeQualifiers", "false"));
  EXPECT_THAT(own, Not(HasSubstr("NAME=\"Caption\""))) << "what is inherited is left out";
  EXPECT_THAT(own, Not(HasSubstr("QUALIFIER")));
}

TEST_F(CimServerTest, ClassNamesAreListedFlatAndDeep) {
  const std::string roots = ask("EnumerateClassNames", "");
  EXPECT_THAT(roots, HasSubstr("<CLASSNAME NAME=\"CIM_Thing\"/>"));
  EXPECT_THAT(roots, Not(HasSubstr("FAKE_Gadget")));
  EXPECT_THAT(ask("EnumerateClassNames",
                  classParameter("CIM_Thing") + valueParameter("DeepInheritance", "TRUE")),
              HasSubstr("<CLASSNAME NAME=\"FAKE_Gadget\"/>"));
  const std::string children = ask("EnumerateClasses", classParameter("CIM_Thing"));
  EXPECT_THAT(children, HasSubstr("<CLASS NAME=\"FAKE_Widget\""));
  EXPECT_THAT(children, Not(HasSubstr("<CLASS NAME=\"FAKE_Gadget\"")));
  EXPECT_THAT(ask("EnumerateClasses", classParameter("FAKE_None")), HasSubstr("CODE=\"5\""));
}

TEST_F(CimServerTest, MethodsTakeTypedArgumentsAndGiveOutputs) {
  const std::string answer = call(
      "Paint", argument("Color", "<VALUE>none</VALUE>") + argument("Coats", "<VALUE> 3 </VALUE>") +
                   argument("Words", "<VALUE.ARRAY><VALUE>a</VALUE><VALUE.NULL/></VALUE.ARRAY>") +
                   argument("Target",
                            "<VALUE.REFERENCE>" + widgetName("widget0", 0) + "</VALUE.REFERENCE>"));
  EXPECT_THAT(answer, HasSubstr("<METHODRESPONSE NAME=\"Paint\"><RETURNVALUE PARAMTYPE=\"uint32\">"
                                "<VALUE>"));
  EXPECT_THAT(answer, HasSubstr("<PARAMVALUE NAME=\"Coats\" PARAMTYPE=\"uint16\">"));
  EXPECT_THAT(answer, HasSubstr("<PARAMVALUE NAME=\"Log\" PARAMTYPE=\"string\"><VALUE.ARRAY>"));
}

TEST_F(CimServerTest, ArgumentsThatDoNotFitAreRefused) {
  EXPECT_THAT(call("Fly", ""), HasSubstr("<ERROR CODE=\"17\""));
  EXPECT_THAT(call("Paint", argument("Wings", "<VALUE>2</VALUE>")), HasSubstr("<ERROR CODE=\"4\""));
  EXPECT_THAT(call("Paint", argument("Coats", "<VALUE>70000</VALUE>")),
              HasSubstr("<ERROR CODE=\"13\" DESCRIPTION=\"'70000' does not fit Coats of type "
                        "uint16\"/>"));
  EXPECT_THAT(call("Paint", argument("Coats", "<VALUE.ARRAY><VALUE>1</VALUE></VALUE.ARRAY>")),
              HasSubstr("<ERROR CODE=\"13\""));
  EXPECT_THAT(call("Paint", argument("Setting", "<VALUE>no instance</VALUE>")),
              HasSubstr("<ERROR CODE=\"4\""));
}

TEST_F(CimServerTest, EmbeddedInstancesAreTextsOfInstances) {
  const std::string setting =
      "&lt;INSTANCE CLASSNAME=\"FAKE_Widget\"&gt;&lt;PROPERTY NAME=\"Color\" TYPE=\"string\"&gt;"
      "&lt;VALUE&gt;blue&lt;/VALUE&gt;&lt;/PROPERTY&gt;&lt;/INSTANCE&gt;";
  EXPECT_THAT(call("Paint", argument("Setting", "<VALUE>" + setting + "</VALUE>")),
              HasSubstr("<RETURNVALUE"));
}

TEST_F(CimServerTest, InstancesEmbeddedTooDeepAreRefused) {
  std::string inner = "<INSTANCE CLASSNAME=\"FAKE_Widget\"></INSTANCE>";
  for (int i = 0; i < 10; ++i) {
    std::string escaped;
    for (const char c : inner) {
      escaped += c == '<' ? "&lt;" : c == '&' ? "&amp;" : std::string(1, c);
    }
    inner = "<INSTANCE CLASSNAME=\"FAKE_Widget\"><PROPERTY NAME=\"Inner\" TYPE=\"string\"><VALUE>" +
            escaped + "</VALUE></PROPERTY></INSTANCE>";
  }
  EXPECT_THAT(ask("CreateInstance", parameter("NewInstance", inner)),
              HasSubstr("instances embedded deeper than 8"));
}

TEST_F(CimServerTest, ParametersOfAnOperationAreChecked) {
  EXPECT_THAT(ask("EnumerateInstances", ""),
              HasSubstr("<ERROR CODE=\"4\" DESCRIPTION=\"EnumerateInstances needs ClassName\"/>"));
  EXPECT_THAT(ask("EnumerateInstances", classParameter("FAKE_Widget") + valueParameter("X", "1")),
              HasSubstr("<ERROR CODE=\"4\" DESCRIPTION=\"EnumerateInstances has no parameter "
                        "'X'\"/>"));
  EXPECT_THAT(
      ask("EnumerateInstances", classParameter("FAKE_Widget") + classParameter("FAKE_Link")),
      HasSubstr("parameter 'ClassName' is there twice"));
  EXPECT_THAT(ask("EnumerateInstances",
                  classParameter("FAKE_Widget") + valueParameter("DeepInheritance", "perhaps")),
              HasSubstr("DeepInheritance is no boolean: 'perhaps'"));
}

TEST_F(CimServerTest, UnknownOperationsAreNotSupported) {
  EXPECT_THAT(ask("OpenEnumerateInstances", ""),
              HasSubstr("<ERROR CODE=\"7\" DESCRIPTION=\"operation OpenEnumerateInstances is not "
                        "supported\"/>"));
}

TEST_F(CimServerTest, UnknownKeysAreRefused) {
  EXPECT_THAT(ask("GetInstance",
                  parameter("InstanceName",
                            "<INSTANCENAME CLASSNAME=\"FAKE_Widget\"><KEYBINDING NAME=\"Wing\">"
                            "<KEYVALUE>x</KEYVALUE></KEYBINDING></INSTANCENAME>")),
              HasSubstr("<ERROR CODE=\"4\""));
}

// ---- Messages that are none ----

struct BadMessage {
  const char* name;
  std::string body;
  unsigned status;
  const char* cimError;
};

class BadMessageTest : public ::testing::TestWithParam<BadMessage> {};

TEST_P(BadMessageTest, IsToldByStatusAndField) {
  try {
    const CimMessage message(GetParam().body);
    FAIL() << "the message was taken";
  } catch (const MessageError& error) {
    EXPECT_EQ(error.status(), GetParam().status) << error.what();
    EXPECT_EQ(error.cimError(), GetParam().cimError) << error.what();
  }
}

std::string nested(int depth) {
  std::string open;
  std::string close;
  for (int i = 0; i < depth; ++i) {
    open += "<A>";
    close += "</A>";
  }
  return open + close;
}

const BadMessage badMessages[] = {
    {"Empty", "", 400, "request-not-well-formed"},
    {"Blank", " \r\n ", 400, "request-not-well-formed"},
    {"NoXml", "hello", 400, "request-not-well-formed"},
    {"Unclosed", "<CIM CIMVERSION=\"2.0\" DTDVERSION=\"2.0\"><MESSAGE>", 400,
     "request-not-well-formed"},
    {"TwoRoots", "<CIM/><CIM/>", 400, "request-not-well-formed"},
    {"NotUtf8", "<CIM a=\"\xFF\"/>", 400, "request-not-well-formed"},
    {"Overlong", "<CIM a=\"\xC0\xAF\"/>", 400, "request-not-well-formed"},
    {"Zero", std::string("<CIM/>\0", 7), 400, "request-not-well-formed"},
    {"Deep", nested(100000), 400, "request-not-well-formed"},
    {"OtherRoot", "<HTML/>", 400, "request-not-valid"},
    {"NoVersion", "<CIM/>", 400, "request-not-valid"},
    {"OtherCim", "<CIM CIMVERSION=\"3.0\" DTDVERSION=\"2.0\"/>", 501, "unsupported-cim-version"},
    {"OtherDtd", "<CIM CIMVERSION=\"2.0\" DTDVERSION=\"1.0\"/>", 501, "unsupported-dtd-version"},
    {"OtherProtocol",
     "<CIM CIMVERSION=\"2.0\" DTDVERSION=\"2.0\"><MESSAGE ID=\"1\" PROTOCOLVERSION=\"2.0\"/></CIM>",
     501, "unsupported-protocol-version"},
    {"NoId", "<CIM CIMVERSION=\"2.0\" DTDVERSION=\"2.0\"><MESSAGE PROTOCOLVERSION=\"1.0\"/></CIM>",
     400, "request-not-valid"},
    {"Several",
     "<CIM CIMVERSION=\"2.0\" DTDVERSION=\"2.0\"><MESSAGE ID=\"1\" PROTOCOLVERSION=\"1.0\">"
     "<MULTIREQ/></MESSAGE></CIM>",
     501, "multiple-requests-unsupported"},
    {"Export",
     "<CIM CIMVERSION=\"2.0\" DTDVERSION=\"2.0\"><MESSAGE ID=\"1\" PROTOCOLVERSION=\"1.0\">"
     "<SIMPLEEXPREQ/></MESSAGE></CIM>",
     501, "unsupported-operation"},
    {"NoCall", test::frame(""), 400, "request-not-valid"},
    {"TwoCalls", test::frame("<IMETHODCALL/><IMETHODCALL/>"), 400, "request-not-valid"},
    {"NoName", test::frame("<IMETHODCALL/>"), 400, "request-not-valid"},
    {"NoNameSpace", test::frame("<IMETHODCALL NAME=\"GetClass\"/>"), 400, "request-not-valid"},
    {"NoTarget", test::frame("<METHODCALL NAME=\"Paint\"/>"), 400, "request-not-valid"},
    {"NamelessParameter", operation("GetClass", "<IPARAMVALUE/>"), 400, "request-not-valid"}};

INSTANTIATE_TEST_SUITE_P(All, BadMessageTest, ::testing::ValuesIn(badMessages),
                         [](const auto& each) { return each.param.name; });

}  // namespace
}  // namespace tvx::host::http
