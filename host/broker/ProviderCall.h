// One call of one provider, from the request's objects to the plain answer.
#pragma once

#include "broker/ProviderLibrary.h"

namespace tvx::host {

/// Used once, on the thread that makes the call.
class ProviderCall {
 public:
  ProviderCall(Core& core, ProviderLibrary& library, const std::string& provider,
               const Request& request);

  Reply run();

 private:
  CMPIStatus callInstance(CMPIInstanceMI* mi);
  CMPIStatus callAssociation(CMPIAssociationMI* mi);
  CMPIStatus callMethod(CMPIMethodMI* mi);
  CMPIStatus dispatch(void* interface);
  void makeObjects();

  Core& m_Core;
  ProviderLibrary& m_Library;
  const std::string& m_Provider;
  const Request& m_Request;
  Reply m_Reply;
  CMPIContext* m_Context = nullptr;
  CMPIResult* m_Result = nullptr;
  CMPIObjectPath* m_Path = nullptr;
  std::vector<const char*> m_Names;
  const char** m_Properties = nullptr;  ///< into m_Names, or null for all
};

/// The path with its keys in the form that the options tell. References in keys likewise.
ObjectPath withServersKeys(const ObjectPath& path, const BrokerOptions& options);

}  // namespace tvx::host
