#include "agent/Map_Insert.h"

#include "runtime/Lasting.h"

namespace cimrt {

namespace {

/// Calls `put` with the field of each reference of the class and the end that belongs there.
template <class End, class Put>
void forEachEnd(Instance* association, std::initializer_list<End*> ends, const Put& put) {
  auto next = ends.begin();
  const Meta_Class* meta = class_of(association);
  for (std::uint64_t i = 0; i < meta->num_meta_features && next != ends.end(); i++) {
    const Meta_Feature* feature = meta->meta_features[i];
    if (is_reference(feature))
      put(*static_cast<Instance**>(storage(association, feature)), *next++);
  }
}

}  // namespace

const String& providerNameSpace() {
  static Lasting<String> name(PROVIDER_NAME_SPACE);
  return *name;
}

bool insertInstance(Instance_Map_Base& map, Ref<Instance> instance, const char* failure) {
  if (map.insert(instance.get()) == Instance_Map_Base::npos) {
    TVX_LOG(TVX_CRIT, "%s", failure);
    return false;
  }
  instance.release();
  return true;
}

bool insertFilled(Instance_Map_Base& map, Ref<Instance> instance, const char* failure) {
  if (map.take(instance) != Instance_Map_Base::npos) return true;
  TVX_LOG(TVX_CRIT, "%s", failure);
  return false;
}

void setEnds(Instance* association, std::initializer_list<const Instance*> ends) {
  forEachEnd(association, ends, [](Instance*& field, const Instance* end) {
    if (end) set_reference(field, clone(end));
  });
}

void shareEnds(Instance* association, std::initializer_list<Instance*> ends) {
  forEachEnd(association, ends, [](Instance*& field, Instance* end) {
    ref(end);
    set_reference(field, end);
  });
}

}  // namespace cimrt
