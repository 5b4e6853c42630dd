// What every operation answers to what cannot be done, and objects in requests that are none.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "Fake_Broker.h"
#include "Raw_Client.h"
#include "Test_Classes.h"
#include "http/CimErrors.h"
#include "http/CimServer.h"

namespace tvx::host::http {
namespace {

using test::classParameter;
using test::frame;
using test::operation;
using test::parameter;
using test::valueParameter;
using test::widgetName;
using ::testing::HasSubstr;
using ::testing::Not;

std::string replaced(std::string text, const std::string& old, const std::string& by) {
  for (std::size_t at = 0; (at = text.find(old, at)) != std::string::npos; at += by.size()) {
    text.replace(at, old.size(), by);
  }
  return text;
}

class Operations : public ::testing::Test {
 protected:
  std::string ask(const std::string& body) { return m_Server.answer(CimMessage(body), "here:1"); }
  std::string get(const std::string& name) {
    return ask(operation("GetInstance", parameter("InstanceName", name)));
  }
  std::string make(const std::string& properties) {
    return ask(operation("CreateInstance",
                         parameter("NewInstance", "<INSTANCE CLASSNAME=\"FAKE_Widget\">" +
                                                      properties + "</INSTANCE>")));
  }

  test::FakeBroker m_Broker;
  CimServer m_Server{m_Broker, test::testClasses()};
};

// ---- Each operation ----

struct Case {
  const char* name;
  std::string parameters;  ///< good ones, of FAKE_Widget
  const char* needed;      ///< the parameter that it cannot do without; null: none
};

class EachOperation : public Operations, public ::testing::WithParamInterface<Case> {};

TEST_P(EachOperation, Succeeds) {
  const std::string answer = ask(operation(GetParam().name, GetParam().parameters));
  EXPECT_THAT(answer, Not(HasSubstr("<ERROR")));
  EXPECT_THAT(answer, HasSubstr(std::string("<IMETHODRESPONSE NAME=\"") + GetParam().name + "\">"));
}

TEST_P(EachOperation, IsFoundInAnyLetters) {
  std::string name(GetParam().name);
  for (char& c : name) {
    c = c >= 'A' && c <= 'Z' ? static_cast<char>(c + 32) : c;
  }
  EXPECT_THAT(ask(operation(name, GetParam().parameters)), Not(HasSubstr("<ERROR")));
}

TEST_P(EachOperation, TellsAnUnknownNameSpace) {
  const std::string body = operation(GetParam().name, GetParam().parameters);
  EXPECT_THAT(ask(replaced(body, "<NAMESPACE NAME=\"fake\"/>", "<NAMESPACE NAME=\"none\"/>")),
              HasSubstr("<ERROR CODE=\"3\" DESCRIPTION=\"no namespace 'root/none' here\"/>"));
}

TEST_P(EachOperation, TellsAnUnknownClass) {
  const std::string parameters = replaced(GetParam().parameters, "FAKE_Widget", "FAKE_None");
  EXPECT_THAT(ask(operation(GetParam().name, parameters)),
              HasSubstr("<ERROR CODE=\"5\" DESCRIPTION=\"no class 'FAKE_None'\"/>"));
}

TEST_P(EachOperation, TellsAMissingParameter) {
  const std::string answer = ask(operation(GetParam().name, ""));
  if (GetParam().needed == nullptr) {
    EXPECT_THAT(answer, Not(HasSubstr("<ERROR")));
    return;
  }
  EXPECT_THAT(answer, HasSubstr("<ERROR CODE=\"4\""));
  EXPECT_THAT(answer, HasSubstr(GetParam().needed));
}

TEST_P(EachOperation, TellsAParameterThatItDoesNotHave) {
  EXPECT_THAT(ask(operation(GetParam().name, GetParam().parameters + valueParameter("Wing", "1"))),
              HasSubstr(std::string("<ERROR CODE=\"4\" DESCRIPTION=\"") + GetParam().name +
                        " has no parameter 'Wing'\"/>"));
}

const std::string instanceParameter = parameter("InstanceName", widgetName("widget2", 2));
const std::string objectParameter = parameter("ObjectName", widgetName("widget2", 2));
const std::string newWidget =
    "<INSTANCE CLASSNAME=\"FAKE_Widget\"><PROPERTY NAME=\"Name\" TYPE=\"string\"><VALUE>new</VALUE>"
    "</PROPERTY></INSTANCE>";
const std::string greenWidget =
    "<VALUE.NAMEDINSTANCE>" + widgetName("widget2", 2) +
    "<INSTANCE CLASSNAME=\"FAKE_Widget\"><PROPERTY NAME=\"Color\" TYPE=\"string\"><VALUE>green"
    "</VALUE></PROPERTY></INSTANCE></VALUE.NAMEDINSTANCE>";

const Case cases[] = {
    {"EnumerateInstances", classParameter("FAKE_Widget"), "ClassName"},
    {"EnumerateInstanceNames", classParameter("FAKE_Widget"), "ClassName"},
    {"GetInstance", instanceParameter, "InstanceName"},
    {"CreateInstance", parameter("NewInstance", newWidget), "an instance is wanted"},
    {"ModifyInstance",
     parameter("ModifiedInstance", greenWidget) +
         parameter("PropertyList", "<VALUE.ARRAY><VALUE>Color</VALUE></VALUE.ARRAY>"),
     "ModifiedInstance"},
    {"DeleteInstance", instanceParameter, "InstanceName"},
    {"Associators", objectParameter, "ObjectName"},
    {"AssociatorNames", objectParameter, "ObjectName"},
    {"References", objectParameter, "ObjectName"},
    {"ReferenceNames", objectParameter, "ObjectName"},
    {"GetClass", classParameter("FAKE_Widget"), "ClassName"},
    {"EnumerateClasses", classParameter("FAKE_Widget"), nullptr},
    {"EnumerateClassNames", classParameter("FAKE_Widget"), nullptr},
    {"GetProperty", instanceParameter + valueParameter("PropertyName", "Color"), "InstanceName"},
    {"SetProperty",
     instanceParameter + valueParameter("PropertyName", "Color") +
         valueParameter("NewValue", "green"),
     "InstanceName"}};

INSTANTIATE_TEST_SUITE_P(All, EachOperation, ::testing::ValuesIn(cases),
                         [](const auto& each) { return each.param.name; });

TEST_F(Operations, PropertiesAreNamed) {
  EXPECT_THAT(ask(operation("GetProperty", instanceParameter)),
              HasSubstr("<ERROR CODE=\"4\" DESCRIPTION=\"GetProperty needs PropertyName\"/>"));
  EXPECT_THAT(ask(operation("SetProperty", instanceParameter + valueParameter("NewValue", "x"))),
              HasSubstr("<ERROR CODE=\"4\" DESCRIPTION=\"SetProperty needs PropertyName\"/>"));
}

TEST_F(Operations, ANameSpaceIsKnownInAnyLetters) {
  EXPECT_THAT(
      ask(replaced(operation("GetInstance", instanceParameter), "NAME=\"fake\"", "NAME=\"FAKE\"")),
      HasSubstr("<VALUE>widget2</VALUE>"));
}

TEST_F(Operations, QueriesAndPullsAreNotSupported) {
  for (const char* name : {"ExecQuery", "OpenEnumerateInstances", "PullInstances", "CreateClass",
                           "ModifyClass", "DeleteClass", "GetQualifier", "SetQualifier"}) {
    EXPECT_THAT(ask(operation(name, "")), HasSubstr("<ERROR CODE=\"7\"")) << name;
  }
}

// ---- Methods ----

class Methods : public Operations {
 protected:
  std::string call(const std::string& target, const std::string& parameters) {
    return ask(frame("<METHODCALL NAME=\"Paint\">" + target + parameters + "</METHODCALL>"));
  }
  static std::string local(const std::string& nameSpace, const std::string& name) {
    return "<LOCALINSTANCEPATH><LOCALNAMESPACEPATH><NAMESPACE NAME=\"root\"/><NAMESPACE NAME=\"" +
           nameSpace + "\"/></LOCALNAMESPACEPATH>" + name + "</LOCALINSTANCEPATH>";
  }
};

TEST_F(Methods, TellUnknownPlacesAndObjects) {
  EXPECT_THAT(call(local("none", widgetName("widget0", 0)), ""), HasSubstr("<ERROR CODE=\"3\""));
  EXPECT_THAT(call(local("fake", widgetName("widget0", 0, "FAKE_None")), ""),
              HasSubstr("<ERROR CODE=\"5\" DESCRIPTION=\"no class 'FAKE_None'\"/>"));
  EXPECT_THAT(call(local("fake", widgetName("widget0", 0, "FAKE_Link")), ""),
              HasSubstr("<ERROR CODE=\"4\""));
}

TEST_F(Methods, TakeAnArgumentOnce) {
  const std::string color = "<PARAMVALUE NAME=\"Color\"><VALUE>red</VALUE></PARAMVALUE>";
  EXPECT_THAT(call(local("fake", widgetName("widget0", 0)), color + color),
              HasSubstr("<ERROR CODE=\"4\" DESCRIPTION=\"parameter 'Color' is there twice\"/>"));
}

TEST_F(Methods, PathsWithoutNameSpaceAreNoMessages) {
  const std::string target =
      "<LOCALINSTANCEPATH>" + widgetName("widget0", 0) + "</LOCALINSTANCEPATH>";
  try {
    call(target, "");
    FAIL() << "the message was taken";
  } catch (const MessageError& error) {
    EXPECT_EQ(error.status(), 400u);
    EXPECT_EQ(error.cimError(), "request-not-valid");
  }
}

// ---- Objects that are none ----

std::string named(const std::string& content) {
  return "<INSTANCENAME CLASSNAME=\"FAKE_Widget\">" + content + "</INSTANCENAME>";
}

std::string binding(const std::string& key, const std::string& kind, const std::string& text) {
  return "<KEYBINDING NAME=\"" + key + "\"><KEYVALUE VALUETYPE=\"" + kind + "\">" + text +
         "</KEYVALUE></KEYBINDING>";
}

TEST_F(Operations, NamesThatAreNoneAreTold) {
  const struct {
    std::string name;
    const char* text;
  } rows[] = {
      {"<VALUE>widget0</VALUE>", "an object path is wanted, found 'VALUE'"},
      {"<INSTANCENAME/>", "INSTANCENAME without CLASSNAME"},
      {named("<KEYBINDING NAME=\"Name\"/>"), "a key without value"},
      {named("<KEYBINDING><KEYVALUE>x</KEYVALUE></KEYBINDING>"), "KEYBINDING without NAME"},
      {named(binding("Name", "string", "a") + binding("Name", "string", "b")),
       "key Name is there twice"},
      {named(binding("Number", "numeric", "seven")), "'seven' is no numeric key"},
      {named(binding("Number", "numeric", "99999999999999999999")),
       "'99999999999999999999' is no numeric key"},
      {named(binding("Number", "color", "1")), "'1' is no color key"},
      {named(binding("Number", "boolean", "maybe")), "'maybe' is no boolean key"},
  };
  for (const auto& row : rows) {
    EXPECT_THAT(get(row.name),
                HasSubstr(std::string("<ERROR CODE=\"4\" DESCRIPTION=\"") + row.text + "\"/>"));
  }
}

TEST_F(Operations, InstancesThatAreNoneAreTold) {
  const std::string color =
      "<PROPERTY NAME=\"Color\" TYPE=\"string\"><VALUE>red</VALUE></PROPERTY>";
  EXPECT_THAT(make(color + color), HasSubstr("<ERROR CODE=\"4\" DESCRIPTION=\"property Color is "
                                             "there twice\"/>"));
  EXPECT_THAT(make("<PROPERTY NAME=\"Wing\" TYPE=\"string\"/>"), HasSubstr("<ERROR CODE=\"12\""));
  EXPECT_THAT(make("<PROPERTY TYPE=\"string\"/>"), HasSubstr("PROPERTY without NAME"));
  EXPECT_THAT(make("<PROPERTY NAME=\"Number\" TYPE=\"uint32\"><VALUE>-1</VALUE></PROPERTY>"),
              HasSubstr("<ERROR CODE=\"13\""));
  EXPECT_THAT(make("<PROPERTY NAME=\"Flag\" TYPE=\"boolean\"><VALUE>2</VALUE></PROPERTY>"),
              HasSubstr("<ERROR CODE=\"13\""));
  EXPECT_THAT(make("<PROPERTY NAME=\"Stamp\" TYPE=\"datetime\"><VALUE>today</VALUE></PROPERTY>"),
              HasSubstr("<ERROR CODE=\"13\""));
  EXPECT_THAT(make("<PROPERTY NAME=\"Inner\" TYPE=\"string\"><VALUE>x&lt;INSTANCE "
                   "CLASSNAME=\"FAKE_Widget\"/&gt;</VALUE></PROPERTY>"),
              HasSubstr("Inner holds no instance: text outside of the root element"));
}

// ---- Texts ----

TEST_F(Operations, EntitiesOfADocumentTypeAreNotExpanded) {
  std::string entities = "<!ENTITY a0 \"aaaaaaaaaa\">";
  for (int i = 1; i < 12; ++i) {
    const std::string inner = "&a" + std::to_string(i - 1) + ";";
    entities +=
        "<!ENTITY a" + std::to_string(i) + " \"" + replaced("..........", ".", inner) + "\">";
  }
  const std::string body =
      replaced(operation("GetInstance", parameter("InstanceName", widgetName("&a11;", 0))),
               "?><CIM", "?><!DOCTYPE CIM [" + entities + "]><CIM");
  EXPECT_THAT(ask(body), HasSubstr("<ERROR CODE=\"6\" DESCRIPTION=\"no such widget\"/>"));
}

TEST_F(Operations, TextAroundTheDocumentIsToldApart) {
  const std::string body = operation("GetInstance", instanceParameter);
  EXPECT_THAT(ask("\r\n" + body + "\r\n<!-- the end -->\n"), HasSubstr(">widget2<"));
  for (const std::string& wrong : {body + "more", "more" + body, body + "<![CDATA[x]]>"}) {
    EXPECT_THROW(CimMessage{wrong}, MessageError);
  }
}

TEST_F(Operations, NestingUpToTheLimitIsTaken) {
  const auto deep = [](int depth) {
    std::string open;
    std::string close;
    for (int i = 0; i < depth; ++i) {
      open += "<A>";
      close += "</A>";
    }
    return operation("GetClass", parameter("ClassName", open + close));
  };
  // CIM, MESSAGE, SIMPLEREQ, IMETHODCALL and IPARAMVALUE are around it.
  EXPECT_NO_THROW(CimMessage{deep(CimMessage::depthLimit - 5)});
  EXPECT_THROW(CimMessage{deep(CimMessage::depthLimit - 4)}, MessageError);
}

}  // namespace
}  // namespace tvx::host::http
