#include "cmpi/Container.h"

#include "runtime/Log.h"

namespace cimrt {

namespace {

Instance* create_record(const Meta_Record* meta_class) {
  return is_method(meta_class) ? create(static_cast<const Meta_Method*>(meta_class))
                               : create(static_cast<const Meta_Class*>(meta_class), false);
}

/// Empties a reference field. `Value::set` is made for fields that hold nothing, but a record that
/// is filled again, or a list that names a reference twice, brings one that does.
void release_targets(Instance* instance, const Meta_Feature* feature) {
  if (!is_reference(feature)) return;
  if (as_reference(feature)->subscript == 0) {
    set_reference(*static_cast<Instance**>(storage(instance, feature)),
                  static_cast<Instance*>(nullptr));
    return;
  }
  auto& targets = *static_cast<Array<Instance*>*>(storage(instance, feature));
  for (Instance* target : targets) unref(target);
  targets.clear();
}

/// Makes every feature null that can be: lists of references too, which the instance's own
/// operation leaves alone.
void nullify(Instance* instance) {
  nullify_properties(instance, true, true, true);
  const Meta_Record* meta_class = instance->meta_class;
  for (std::uint64_t i = 0; i < meta_class->num_meta_features; ++i) {
    const Meta_Feature* feature = meta_class->meta_features[i];
    if (is_reference(feature) && as_reference(feature)->subscript != 0)
      *null_flag(instance, feature) = 1;
  }
}

/// Stores a value, and its null mark where the value itself does not carry it over.
int store(const Value& value, Instance* instance, const Meta_Feature* feature) {
  release_targets(instance, feature);
  if (value.set(instance, feature) != 0) return -1;
  if (value.type() == INSTANCE_ARRAY) *null_flag(instance, feature) = value.null() ? 1 : 0;
  return 0;
}

}  // namespace

bool is_null(const Instance* instance, const Meta_Feature* feature) {
  const std::uint8_t* flag = null_flag(instance, feature);
  if (flag) return *flag != 0;
  return *static_cast<Instance* const*>(storage(instance, feature)) == nullptr;
}

int Container::convert(const Meta_Record* meta_class, std::uint32_t flags, Instance*& instance) {
  Ref<Instance> made;
  if (!instance) made.reset(create_record(meta_class));
  Instance* record = made ? made.get() : instance;
  if (!record) return -1;
  nullify(record);

  const std::uint32_t size = get_size();
  for (std::uint32_t index = 0; index < size; ++index) take(index, meta_class, flags, record);

  if (made) instance = made.release();
  return 0;
}

void Container::take(std::uint32_t index, const Meta_Record* meta_class, std::uint32_t flags,
                     Instance* instance) {
  String name;
  if (get_name(index, name) != 0) {
    CIMRT_TRACE(LOG_WARN_, "get_name() failed: class=%s, index=%u", meta_class->name, index);
    return;
  }
  const Meta_Feature* feature =
      find_feature(meta_class, name.c_str(), FLAG_PROPERTY | FLAG_REFERENCE);
  if (!feature) {
    CIMRT_TRACE(LOG_WARN_, "unknown feature: %s.%s", meta_class->name, name.c_str());
    return;
  }
  if (flags != 0 && (feature->flags & flags) == 0) return;

  const Type type = feature_type(feature);
  if (type == NONE) {
    CIMRT_TRACE(LOG_WARN_, "unexpected error: %s.%s", meta_class->name, name.c_str());
    return;
  }
  Value value;
  if (get_value(index, type, value) != 0 || store(value, instance, feature) != 0)
    CIMRT_TRACE(LOG_WARN_, "unexpected failure: %s.%s", meta_class->name, name.c_str());
}

int Container::convert(const Instance* instance, std::uint32_t flags) {
  if (!instance) {
    CIMRT_TRACE(LOG_WARN_, "ignored null instance arg");
    return -1;
  }
  const Meta_Record* meta_class = instance->meta_class;
  for (std::uint64_t i = 0; i < meta_class->num_meta_features; ++i) {
    const Meta_Feature* feature = meta_class->meta_features[i];
    if (is_method(feature)) continue;
    if (flags != 0 && (feature->flags & flags) == 0) continue;
    if (!is_null(instance, feature)) give(instance, feature);
  }
  return 0;
}

void Container::give(const Instance* instance, const Meta_Feature* feature) {
  Value value;
  if (value.get(instance, feature) != 0) {
    CIMRT_TRACE(LOG_WARN_, "unexpected failure: %s.%s", instance->meta_class->name, feature->name);
    return;
  }
  if (set_value(feature->name, value, feature->flags) != 0)
    CIMRT_TRACE(LOG_WARN_, "conversion error: %s.%s", instance->meta_class->name, feature->name);
}

}  // namespace cimrt
