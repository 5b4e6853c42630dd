#include "http/CimMessage.h"

#include <fmt/format.h>

#include <algorithm>
#include <string_view>

#include "http/CimErrors.h"
#include "http/XmlText.h"

namespace tvx::host::http {
namespace {

constexpr unsigned badRequest = 400;
constexpr unsigned notImplemented = 501;

[[noreturn]] void notWellFormed(const std::string& text) {
  throw MessageError(badRequest, "request-not-well-formed", text);
}

[[noreturn]] void notValid(const std::string& text) {
  throw MessageError(badRequest, "request-not-valid", text);
}

bool isElement(const pugi::xml_node& node) {
  return node.type() == pugi::node_element;
}

std::string_view nameOf(const pugi::xml_node& node) {
  return node.name();
}

/// The document's one element.
pugi::xml_node onlyRoot(const pugi::xml_document& document) {
  pugi::xml_node root;
  for (const pugi::xml_node& child : document.children()) {
    if (!isElement(child) && !trimmed(child.value()).empty()) {
      notWellFormed("text outside of the root element");
    }
    if (isElement(child) && root) {
      notWellFormed("more than one root element");
    }
    root = isElement(child) ? child : root;
  }
  if (!root) {
    notWellFormed("no root element");
  }
  return root;
}

/// Walks without recursion, so that any depth can be told.
void checkDepth(const pugi::xml_node& root) {
  pugi::xml_node node = root;
  int depth = 1;
  while (node) {
    if (depth > CimMessage::depthLimit) {
      notWellFormed(fmt::format("elements nested deeper than {}", CimMessage::depthLimit));
    }
    if (node.first_child()) {
      node = node.first_child();
      ++depth;
      continue;
    }
    while (node && node != root && !node.next_sibling()) {
      node = node.parent();
      --depth;
    }
    node = node == root ? pugi::xml_node() : node.next_sibling();
  }
}

/// The element's attribute, which must be there.
std::string requiredAttribute(const pugi::xml_node& element, const char* name) {
  const pugi::xml_attribute attribute = element.attribute(name);
  if (attribute.empty() || *attribute.value() == '\0') {
    notValid(fmt::format("{} without {}", element.name(), name));
  }
  return attribute.value();
}

void checkVersion(const pugi::xml_node& element, const char* attribute, std::string_view prefix,
                  const char* cimError) {
  const std::string version = requiredAttribute(element, attribute);
  if (!version.starts_with(prefix)) {
    throw MessageError(notImplemented, cimError,
                       fmt::format("{} {} is not supported", attribute, version));
  }
}

pugi::xml_node onlyChild(const pugi::xml_node& parent) {
  pugi::xml_node found;
  for (const pugi::xml_node& child : parent.children()) {
    if (isElement(child) && found) {
      notValid(fmt::format("{} with more than one child", parent.name()));
    }
    found = isElement(child) ? child : found;
  }
  if (!found) {
    notValid(fmt::format("{} without a child", parent.name()));
  }
  return found;
}

}  // namespace

std::string elementText(const pugi::xml_node& element) {
  std::string text;
  for (const pugi::xml_node& child : element.children()) {
    text += child.value();
  }
  return text;
}

pugi::xml_node firstElement(const pugi::xml_node& parent) {
  for (const pugi::xml_node& child : parent.children()) {
    if (isElement(child)) {
      return child;
    }
  }
  return {};
}

pugi::xml_node parseXml(pugi::xml_document& document, std::string& text) {
  if (!isXmlText(text)) {
    notWellFormed("not UTF-8, or characters that XML cannot hold");
  }
  // As a fragment, so that text outside of elements is seen, not dropped.
  constexpr unsigned options = pugi::parse_cdata | pugi::parse_escapes |
                               pugi::parse_wconv_attribute | pugi::parse_eol |
                               pugi::parse_ws_pcdata_single | pugi::parse_fragment;
  const pugi::xml_parse_result result =
      document.load_buffer_inplace(text.data(), text.size(), options, pugi::encoding_utf8);
  if (!result) {
    notWellFormed(fmt::format("{} at byte {}", result.description(), result.offset));
  }
  const pugi::xml_node root = onlyRoot(document);
  checkDepth(root);
  return root;
}

std::string readNameSpace(const pugi::xml_node& localNameSpacePath) {
  std::string text;
  for (const pugi::xml_node& child : localNameSpacePath.children("NAMESPACE")) {
    text += (text.empty() ? "" : "/") + requiredAttribute(child, "NAME");
  }
  if (nameOf(localNameSpacePath) != "LOCALNAMESPACEPATH" || text.empty()) {
    notValid("a namespace path without names");
  }
  return text;
}

CimMessage::CimMessage(std::string body) : m_Body(std::move(body)) {
  parse();
}

void CimMessage::parse() {
  // Some clients put line ends before the XML declaration.
  m_Body.erase(0, std::min(m_Body.find_first_not_of(" \t\r\n"), m_Body.size()));
  const pugi::xml_node root = parseXml(m_Document, m_Body);
  if (nameOf(root) != "CIM") {
    notValid("the root element is not CIM");
  }
  checkVersion(root, "CIMVERSION", "2.", "unsupported-cim-version");
  checkVersion(root, "DTDVERSION", "2.", "unsupported-dtd-version");
  const pugi::xml_node message = onlyChild(root);
  if (nameOf(message) != "MESSAGE") {
    notValid("CIM without MESSAGE");
  }
  readMessage(message);
}

void CimMessage::readMessage(const pugi::xml_node& message) {
  m_Id = requiredAttribute(message, "ID");
  checkVersion(message, "PROTOCOLVERSION", "1.", "unsupported-protocol-version");
  const pugi::xml_node request = onlyChild(message);
  if (nameOf(request) == "MULTIREQ") {
    throw MessageError(notImplemented, "multiple-requests-unsupported", "one request a message");
  }
  if (nameOf(request) == "SIMPLEEXPREQ" || nameOf(request) == "MULTIEXPREQ") {
    throw MessageError(notImplemented, "unsupported-operation", "no export messages here");
  }
  if (nameOf(request) != "SIMPLEREQ") {
    notValid("MESSAGE without SIMPLEREQ");
  }
  readCall(onlyChild(request));
}

void CimMessage::readCall(const pugi::xml_node& call) {
  m_bIntrinsic = nameOf(call) == "IMETHODCALL";
  if (!m_bIntrinsic && nameOf(call) != "METHODCALL") {
    notValid("SIMPLEREQ without a call");
  }
  m_Name = requiredAttribute(call, "NAME");
  if (m_bIntrinsic) {
    readOperation(call);
  } else {
    readMethodCall(call);
  }
}

void CimMessage::readOperation(const pugi::xml_node& call) {
  m_NameSpace = readNameSpace(firstElement(call));
  for (const pugi::xml_node& child : call.children("IPARAMVALUE")) {
    readParameter(child);
  }
}

void CimMessage::readMethodCall(const pugi::xml_node& call) {
  m_Target = firstElement(call);
  if (nameOf(m_Target) != "LOCALINSTANCEPATH" && nameOf(m_Target) != "LOCALCLASSPATH") {
    notValid("METHODCALL without the path of an instance or class");
  }
  for (const pugi::xml_node& child : call.children("PARAMVALUE")) {
    readParameter(child);
  }
}

void CimMessage::readParameter(const pugi::xml_node& element) {
  m_Parameters.push_back({requiredAttribute(element, "NAME"), element});
}

}  // namespace tvx::host::http
