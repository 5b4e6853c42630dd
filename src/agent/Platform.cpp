#include "agent/Platform.h"

#include "agent/MapBuild.h"
#include "cmpi/cimom.h"
#include "runtime/Meta_Class.h"

namespace cimrt {

Ref<Instance> findOnPlatform(const Meta_Class* wanted, const Meta_Class* kind) {
  const Ref<Instance> model(create(wanted, true));
  Instance_Enumerator results;
  if (cimom::enum_instances(PLATFORM_NAME_SPACE, model.get(), results) != 0) return Ref<Instance>();
  for (; results.more(); results.next()) {
    const Ref<Instance> result = results.get();
    if (!result || !is_subclass(kind, class_of(result.get()))) continue;
    Ref<Instance> found(clone(result.get()));
    found->__name_space = PLATFORM_NAME_SPACE;
    return found;
  }
  return Ref<Instance>();
}

}  // namespace cimrt
