#include "logs/Profile_Providers.h"

#include "agent/Map_Insert.h"
#include "agent/RegisteredProfiles.h"
#include "cmpi/cimom.h"
#include "common/CLogger.h"

namespace cimrt {

namespace {

constexpr const char* BASE_SERVER = "Base Server";

bool isBaseServer(const Instance* instance) {
  if (!instance || !is_subclass(&CIM_RegisteredProfile::static_meta_class, class_of(instance)))
    return false;
  const auto* profile = static_cast<const CIM_RegisteredProfile*>(instance);
  return !profile->RegisteredName.is_null() && profile->RegisteredName.value == BASE_SERVER;
}

/// A clone of the Base Server profile among the results; null if it is not there.
Ref<Instance> takeBaseServer(Instance_Enumerator& results) {
  for (; results.more(); results.next()) {
    const Ref<Instance> result = results.get();
    if (!isBaseServer(result.get())) continue;
    TVX_LOG(TVX_DBG,
            "up-call - found the correct OMC_RegisteredBaseServerProfile/PG_RegisteredProfile to "
            "link");
    return Ref<Instance>(clone(result.get()));
  }
  return Ref<Instance>();
}

/// Asks the CIM server for the Base Server profile of the host.
Ref<Instance> findBaseServerProfile() {
  TVX_LOG(TVX_DBG,
          "up-call to enumerate OMC_RegisteredBaseServerProfile/PG_RegisteredProfile started");
  const Ref<Instance> model(create(&PG_RegisteredProfile::static_meta_class, true));
  TVX_LOG(TVX_DBG,
          "up-call to enumerate OMC_RegisteredBaseServerProfile/OMC_RegisteredBaseServerProfile/"
          "PG_RegisteredProfile created--calling now");
  Instance_Enumerator results;
  if (!model || cimom::enum_instances(INTEROP_NAME_SPACE, model.get(), results) != 0) {
    TVX_LOG(TVX_DBG,
            "up-call to enumerate OMC_RegisteredBaseServerProfile/PG_RegisteredProfile failed");
    return Ref<Instance>();
  }
  TVX_LOG(TVX_DBG,
          "up-call to enumerate OMC_RegisteredBaseServerProfile/PG_RegisteredProfile Passed");
  return takeBaseServer(results);
}

/// Delivers an association of class T from `antecedent` to each of the referenced profiles.
template <class T>
void deliverReferences(const Instance* antecedent, const Instance_Handler& handler) {
  for (const Profile_Row& row : referencedProfiles()) {
    const Ref<TVXHBA_RegisteredProfile> dependent = makeRegisteredProfile(row);
    if (!handler.handle(makeAssociation<T>(antecedent, dependent.get()).release())) return;
  }
}

bool librariesAreLoaded() {
  return ProviderAgent::getInstance()->isLoaded();
}

}  // namespace

std::int32_t TVXHBA_RegisteredProfile_Provider::enum_instances(const TVXHBA_RegisteredProfile*,
                                                               const Instance_Handler& handler) {
  TVX_LOG(TVX_DBG, "TVXHBA_RegisteredProfile_Provider::enum_instances()");
  if (!librariesAreLoaded()) return ENUM_INSTANCES_OK;
  for (const Profile_Row& row : enumeratedProfiles())
    if (!handler.handle(makeRegisteredProfile(row).release())) break;
  return ENUM_INSTANCES_OK;
}

std::int32_t TVXHBA_ReferencedProfile_Provider::enum_instances(const TVXHBA_ReferencedProfile*,
                                                               const Instance_Handler& handler) {
  TVX_LOG(TVX_DBG, "TVXHBA_ReferencedProfile_Provider::enum_instances()");
  if (!librariesAreLoaded()) return ENUM_INSTANCES_OK;
  const Ref<TVXHBA_RegisteredProfile> registration =
      makeRegisteredProfile(enumeratedProfiles().front());
  deliverReferences<TVXHBA_ReferencedProfile>(registration.get(), handler);
  return ENUM_INSTANCES_OK;
}

std::int32_t TVXHBA_BaseServerReferencedProfile_Provider::enum_instances(
    const TVXHBA_BaseServerReferencedProfile*, const Instance_Handler& handler) {
  TVX_LOG(TVX_DBG, "TVXHBA_BaseServerReferencedProfile_Provider::enum_instances()");
  if (!librariesAreLoaded()) return ENUM_INSTANCES_OK;
  const Ref<Instance> baseServer = findBaseServerProfile();
  if (baseServer) deliverReferences<TVXHBA_BaseServerReferencedProfile>(baseServer.get(), handler);
  return ENUM_INSTANCES_OK;
}

}  // namespace cimrt
