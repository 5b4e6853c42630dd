#include "diagnostics/TVXHBA_HelpService_Provider.h"

#include "agent/Service_Call.h"

namespace cimrt {

namespace {

constexpr std::uint32_t RESULT_OK = 0;
constexpr std::uint32_t RESULT_NO_DOCUMENT = 4;
constexpr std::uint32_t RESULT_INVALID = 5;
constexpr std::uint16_t AS_TEXT = 1;

/// The service of that name that has the document, whatever the case of both; or null.
const TVXHBA_HelpService* findDocument(const ProviderAgent& agent, const String& name,
                                       const String& document) {
  const auto& services = agent.m_TVXHBA_HelpService_map;
  for (std::size_t i = 0; i < services.size(); i++) {
    const TVXHBA_HelpService& service = *services[i];
    const Array<String>& documents = service.DocumentsAvailable.value;
    if (documents.size() != 0 && documents[0].equali(document) && service.Name.value.equali(name))
      return &service;
  }
  return nullptr;
}

bool isKnown(const ProviderAgent& agent, const TVXHBA_HelpService* service) {
  if (agent.m_TVXHBA_HelpService_map.find(service) != Instance_Map_Base::npos) return true;
  TVX_LOG(TVX_DBG, "Invalid instance of Help Service");
  return false;
}

}  // namespace

std::int32_t TVXHBA_HelpService_Provider::GetHelp(const TVXHBA_HelpService* service,
                                                  const Property<String>& RequestedDocument,
                                                  const Property<std::uint16_t>& Format,
                                                  const Property<std::uint16_t>& RequestedDelivery,
                                                  Property<String>& DocumentInfo,
                                                  Property<std::uint32_t>& return_value) {
  Service_Call call;
  return_value.set(RESULT_INVALID);
  if (!isKnown(call.agent, service)) return INVOKE_METHOD_OK;
  if (RequestedDocument.is_null() || Format.is_null() || RequestedDelivery.is_null()) {
    TVX_LOG(TVX_DBG, "Invalid Requested Document");
    return INVOKE_METHOD_OK;
  }
  const TVXHBA_HelpService* found =
      findDocument(call.agent, service->Name.value, RequestedDocument.value);
  if (!found) {
    return_value.set(RESULT_NO_DOCUMENT);
    return INVOKE_METHOD_OK;
  }
  if (Format.value != AS_TEXT || RequestedDelivery.value != AS_TEXT) {
    TVX_LOG(TVX_DBG, "Unsupported Delivery options, Use '1' for proper support");
    return INVOKE_METHOD_OK;
  }
  const Array<String>& descriptions = found->DocumentDescriptions.value;
  DocumentInfo.set(descriptions.size() != 0 ? descriptions[0] : String());
  return_value.set(RESULT_OK);
  return INVOKE_METHOD_OK;
}

}  // namespace cimrt
