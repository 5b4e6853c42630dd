#include "agent/Map_Insert.h"

namespace cimrt {

bool insertInstance(Instance_Map_Base& map, Ref<Instance> instance, const char* failure) {
  if (map.insert(instance.get()) == Instance_Map_Base::npos) {
    TVX_LOG(TVX_CRIT, "%s", failure);
    return false;
  }
  instance.release();
  return true;
}

void setEnds(Instance* association, std::initializer_list<const Instance*> ends) {
  const Instance* const* next = ends.begin();
  const Meta_Class* meta = class_of(association);
  for (std::uint64_t i = 0; i < meta->num_meta_features && next != ends.end(); i++) {
    const Meta_Feature* feature = meta->meta_features[i];
    if (!is_reference(feature)) continue;
    auto** field = static_cast<Instance**>(storage(association, feature));
    if (const Instance* end = *next++) set_reference(*field, clone(end));
  }
}

}  // namespace cimrt
