// The chassis that the cards stand in.
#include "agent/MapSteps.h"
#include "agent/Map_Insert.h"
#include "agent/Platform.h"

namespace cimrt {

std::int32_t findPlatformChassis(Host_Build& host) {
  TVX_LOG(TVX_DBG, "up-call to enumerate CIM_Chassis started");
  host.platformChassis = findOnPlatform<CIM_Chassis>(&IBMSD_Chassis::static_meta_class);
  host.chassis = host.platformChassis.get();
  TVX_LOG(TVX_DBG, host.chassis ? "up-call - found the correct CIM_Chassis to link"
                                : "up-call method to get the chassis is failed");
  return 0;
}

std::int32_t buildOwnChassis(Host_Build& host) {
  if (host.chassis) return 0;
  Ref<CIM_Chassis> chassis = makeInstance<CIM_Chassis>();
  chassis->Tag.set("TVX HBA:Chassis");
  chassis->ElementName.set("TVX HBA:Chassis");
  chassis->CreationClassName.set("CIM_Chassis");
  chassis->PackageType.set(3);
  chassis->ChassisPackageType.set(0);
  host.chassis = insertInto(host.agent.m_CIM_Chassis_map, std::move(chassis),
                            "Insert Failed : m_CIM_Chassis_map");
  if (host.chassis) return 0;
  TVX_LOG(TVX_CRIT, "Could not create the Chassis Instance");
  return MAP_BUILD_FAILED;
}

}  // namespace cimrt
