// One request message, read from XML and checked for its frame.
#pragma once

#include <pugixml.hpp>
#include <string>
#include <vector>

namespace tvx::host::http {

/// An operation (IMETHODCALL) or a method call (METHODCALL) with its parameters still as elements,
/// since their types depend on what is called. Not synchronised.
class CimMessage {
 public:
  struct Parameter {
    std::string name;
    pugi::xml_node element;  ///< IPARAMVALUE or PARAMVALUE
  };

  /// Elements may be nested this deep, which no proper request comes near.
  static constexpr int depthLimit = 64;

  /// Reads a body. Throws MessageError: request-not-well-formed for what is no XML, UTF-8 or nested
  /// too deep; request-not-valid for what is no request; unsupported-... for other versions,
  /// export messages and several requests in one.
  explicit CimMessage(std::string body);
  CimMessage(const CimMessage&) = delete;
  CimMessage& operator=(const CimMessage&) = delete;

  const std::string& id() const { return m_Id; }
  /// True for one of the server's own operations, false for a method of a class.
  bool isIntrinsic() const { return m_bIntrinsic; }
  const std::string& name() const { return m_Name; }
  /// Of the operation, "root/torvex". Empty for a method: it is part of the target.
  const std::string& nameSpace() const { return m_NameSpace; }
  /// LOCALINSTANCEPATH or LOCALCLASSPATH of a method call.
  pugi::xml_node target() const { return m_Target; }
  const std::vector<Parameter>& parameters() const { return m_Parameters; }

 private:
  void parse();
  void readMessage(const pugi::xml_node& message);
  void readCall(const pugi::xml_node& call);
  void readOperation(const pugi::xml_node& call);
  void readMethodCall(const pugi::xml_node& call);
  void readParameter(const pugi::xml_node& element);

  std::string m_Body;  ///< the document's texts lie in it
  pugi::xml_document m_Document;
  std::string m_Id;
  bool m_bIntrinsic = true;
  std::string m_Name;
  std::string m_NameSpace;
  pugi::xml_node m_Target;
  std::vector<Parameter> m_Parameters;
};

/// Text of a LOCALNAMESPACEPATH element. Throws MessageError (request-not-valid) if it has none.
std::string readNameSpace(const pugi::xml_node& localNameSpacePath);

/// All character data of an element, in CDATA sections or not.
std::string elementText(const pugi::xml_node& element);

/// The first child that is an element, or null.
pugi::xml_node firstElement(const pugi::xml_node& parent);

/// Parses `text` in place and checks characters, nesting and that there is one root element, which
/// is returned. Throws MessageError (request-not-well-formed).
pugi::xml_node parseXml(pugi::xml_document& document, std::string& text);

}  // namespace tvx::host::http
