#include "derivedObjects/Skeleton_Provider.h"

#include <string>

#include "agent/ProviderAgent.h"
#include "common/CLogger.h"

namespace cimrt {

void Skeleton_Provider::log_call(const char* operation) const {
  static constexpr unsigned line = __LINE__;
  const std::string source = std::string("derivedObjects/") + _entry.provider_name;
  getLogger().log(source.c_str(), &line, TVX_DBG, "%s::%s()", _entry.provider_name, operation);
}

std::int32_t Skeleton_Provider::load() {
  return ProviderAgent::acquire();
}

std::int32_t Skeleton_Provider::unload() {
  log_call("unload");
  ProviderAgent::releaseRef();
  return UNLOAD_OK;
}

std::int32_t Skeleton_Provider::get_instance(const Instance*, Instance*&) {
  return GET_INSTANCE_UNSUPPORTED;
}

std::int32_t Skeleton_Provider::enum_instances(const Instance*, const Instance_Handler& handler) {
  if (_entry.enumerate) _entry.enumerate(*ProviderAgent::getInstance(), handler);
  log_call("enum_instances");
  return ENUM_INSTANCES_OK;
}

std::int32_t Skeleton_Provider::create_instance(const Instance*) {
  return CREATE_INSTANCE_UNSUPPORTED;
}

std::int32_t Skeleton_Provider::delete_instance(const Instance*) {
  return DELETE_INSTANCE_UNSUPPORTED;
}

std::int32_t Skeleton_Provider::modify_instance(const Instance*, const Instance*) {
  return MODIFY_INSTANCE_UNSUPPORTED;
}

std::int32_t Skeleton_Provider::enum_associator_names(const Instance*, const String&, const String&,
                                                      const String&, const Instance_Handler&) {
  return ENUM_ASSOCIATOR_NAMES_UNSUPPORTED;
}

std::int32_t Skeleton_Provider::enum_references(const Instance*, const Instance*, const String&,
                                                const Instance_Handler&) {
  return ENUM_REFERENCES_UNSUPPORTED;
}

std::int32_t Skeleton_Provider::enum_associators(const Instance*, const String&, const String&,
                                                 const String&, const Instance_Handler&) {
  return ENUM_ASSOCIATORS_UNSUPPORTED;
}

std::int32_t Skeleton_Provider::invoke(const Meta_Method*, Instance*, Instance*) {
  return INVOKE_METHOD_UNSUPPORTED;
}

Skeleton_Provider* create_skeleton(const Provider_Entry& entry) {
  return new Skeleton_Provider(entry);
}

}  // namespace cimrt
