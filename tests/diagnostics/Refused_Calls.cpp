#include "Refused_Calls.h"

#include <utility>

#include "access/TVX_MethodWrapper.h"

// The linker gives calls of a wrapped symbol the name with "__wrap_", and the function itself the
// one with "__real_".
#define TVX_ID_TO_NAME "_ZN5cimrt17TVX_MethodWrapper10Id2HBANameEPcPKc"
#define TVX_MAP_INSERT "_ZN5cimrt17Instance_Map_Base6insertEPNS_8InstanceE"

namespace cimrt::test {

namespace {

Refuse_Name refusesName;
Refuse_Insert refusesInsert;

}  // namespace

RM_STATUS convert(char* name, const char* deviceID) __asm__("__real_" TVX_ID_TO_NAME);
RM_STATUS convertUnlessRefused(char* name, const char* deviceID) __asm__("__wrap_" TVX_ID_TO_NAME);
std::size_t insert(Instance_Map_Base* map, Instance* instance) __asm__("__real_" TVX_MAP_INSERT);
std::size_t insertUnlessRefused(Instance_Map_Base* map,
                                Instance* instance) __asm__("__wrap_" TVX_MAP_INSERT);

RM_STATUS convertUnlessRefused(char* name, const char* deviceID) {
  return refusesName && refusesName(deviceID) ? RM_ERROR : convert(name, deviceID);
}

std::size_t insertUnlessRefused(Instance_Map_Base* map, Instance* instance) {
  return refusesInsert && refusesInsert(*instance) ? Instance_Map_Base::npos
                                                   : insert(map, instance);
}

Refused_Calls::Refused_Calls(Refuse_Name name, Refuse_Insert insert) {
  refusesName = std::move(name);
  refusesInsert = std::move(insert);
}

Refused_Calls::~Refused_Calls() {
  refusesName = {};
  refusesInsert = {};
}

}  // namespace cimrt::test
