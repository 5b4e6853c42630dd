#include "agent/Map_Insert.h"

#include <cstdarg>

#include "runtime/Buffer.h"

namespace cimrt {

std::string formatText(const char* format, ...) {
  Buffer buffer;
  va_list args;
  va_start(args, format);
  buffer.vformat(format, args);
  va_end(args);
  return std::string(buffer.data(), buffer.size());
}

bool insertInstance(Instance_Map_Base& map, Ref<Instance> instance, const char* failure) {
  if (map.insert(instance.get()) == Instance_Map_Base::npos) {
    TVX_LOG(TVX_CRIT, "%s", failure);
    return false;
  }
  instance.release();
  return true;
}

void setEnds(Instance* association, const Instance* first, const Instance* second) {
  const Instance* ends[] = {first, second};
  std::size_t next = 0;
  const Meta_Class* meta = class_of(association);
  for (std::uint64_t i = 0; i < meta->num_meta_features && next < 2; i++) {
    const Meta_Feature* feature = meta->meta_features[i];
    if (!is_reference(feature)) continue;
    auto** field = static_cast<Instance**>(storage(association, feature));
    set_reference(*field, clone(ends[next++]));
  }
}

}  // namespace cimrt
