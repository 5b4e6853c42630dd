// One operation or method call on its way through the server.
#pragma once

#include <optional>
#include <string>
#include <vector>

#include "Broker.h"
#include "cim/ClassCatalogue.h"
#include "http/CimMessage.h"
#include "http/CimServer.h"
#include "http/ObjectReader.h"
#include "http/XmlWriter.h"

namespace tvx::host::http {

/// Reads the parameters of a message, sends the request and writes the elements of the result.
/// Every function throws CimError with what the client is told.
class OperationCall {
 public:
  OperationCall(Broker& broker, const ClassCatalogue& classes,
                const CimServer::Accountant& accountant, const CimMessage& message,
                const std::string& host)
      : m_Broker(broker),
        m_Classes(classes),
        m_Accountant(accountant),
        m_Message(message),
        m_Reader(classes, message.nameSpace()),
        m_Writer(m_Out, classes, host) {}

  /// Runs what the message asks for; the content of IMETHODRESPONSE or METHODRESPONSE.
  std::string run();

 private:
  struct Row;
  static const Row rows[];

  // ---- The operations ----
  void enumerateInstances();
  void enumerateInstanceNames();
  void getInstance();
  void createInstance();
  void modifyInstance();
  void deleteInstance();
  void associators();
  void associatorNames();
  void references();
  void referenceNames();
  void getClass();
  void enumerateClasses();
  void enumerateClassNames();
  void getProperty();
  void setProperty();
  void invokeMethod();

  // ---- Parameters ----
  void checkParameters(const Row& row) const;
  void checkOnce() const;
  const CimMessage::Parameter* find(const char* name) const;
  pugi::xml_node element(const char* name) const;
  ObjectPath requiredPath(const char* name) const;
  std::string text(const char* name) const;
  std::string requiredText(const char* name) const;
  bool flag(const char* name, bool otherwise) const;
  std::string classNameText(const char* name) const;
  std::optional<std::vector<std::string>> propertyList() const;
  Selection selection() const;
  Selection classSelection() const;

  // ---- Requests ----
  Request request(Operation operation, ObjectPath path) const;
  Request walk(Operation operation) const;
  Reply send(const Request& request);
  void writeObjects(const Reply& reply);
  void writePaths(const Reply& reply);
  void modify(Instance instance, PropertyList properties);

  // ---- Classes ----
  const ClassData& requireClass(const std::string& name) const;
  void requireNameSpace() const;
  std::vector<const ClassData*> wantedClasses() const;

  Broker& m_Broker;
  const ClassCatalogue& m_Classes;
  const CimServer::Accountant& m_Accountant;
  const CimMessage& m_Message;
  ObjectReader m_Reader;
  std::string m_Out;
  XmlWriter m_Writer;
};

}  // namespace tvx::host::http
