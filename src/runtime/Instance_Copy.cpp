// Copying between instances, null flags and requested property lists.
#include <cstring>

#include "runtime/Instance.h"
#include "runtime/Key_Features.h"

namespace cimrt {
namespace {

using Instances = Array<Instance*>;

bool has_storage(const Meta_Feature* f) {
  return is_property(f) || is_reference(f);
}

void empty_references(Instances& elements) {
  for (Instance* element : elements) unref(element);
  elements.clear();
}

/// Puts clones of the source's elements in the place of those that `elements` has. Without memory
/// for them it stays as it is.
void copy_references(Instances& elements, const Instances& source) {
  Instances before = elements;
  Instances clones;
  try {
    clones.reserve(source.size());
    for (const Instance* element : source) clones.append(clone_or_null(element));
    elements = clones;
  } catch (...) {
    empty_references(clones);
    throw;
  }
  empty_references(before);
}

void copy_reference(Instance* dest, const Instance* src, const Meta_Reference* mr) {
  if (mr->subscript == 0) {
    // Cloned first: the source's target may be the one that is released.
    set_reference(target_of(dest, mr), clone_or_null(target_of(src, mr)));
    return;
  }
  copy_references(targets_of(dest, mr), targets_of(src, mr));
  *null_flag(dest, mr) = *null_flag(src, mr);
}

void copy_property(Instance* dest, const Instance* src, const Meta_Property* mp) {
  *null_flag(dest, mp) = *null_flag(src, mp);
  void* to = storage(dest, mp);
  const void* from = storage(src, mp);
  if (mp->subscript != 0) {
    *static_cast<Array_Base*>(to) = *static_cast<const Array_Base*>(from);
  } else if (mp->type == STRING) {
    *static_cast<String*>(to) = *static_cast<const String*>(from);
  } else if (mp->type == DATETIME) {
    *static_cast<Datetime*>(to) = *static_cast<const Datetime*>(from);
  } else {
    std::memmove(to, from, type_size_table[mp->type]);
  }
}

void copy_feature(Instance* dest, const Instance* src, const Meta_Feature* f) {
  if (is_property(f)) {
    copy_property(dest, src, as_property(f));
  } else if (is_reference(f)) {
    copy_reference(dest, src, as_reference(f));
  }
}

void clear_property(Instance* instance, const Meta_Property* mp) {
  void* p = storage(instance, mp);
  if (mp->subscript != 0) {
    static_cast<Array_Base*>(p)->clear();
  } else if (mp->type == STRING) {
    static_cast<String*>(p)->clear();
  } else if (mp->type == DATETIME) {
    static_cast<Datetime*>(p)->clear();
  } else {
    std::memset(p, 0, type_size_table[mp->type]);
  }
  *null_flag(instance, mp) = 1;
}

void clear_reference(Instance* instance, const Meta_Reference* mr) {
  if (mr->subscript == 0) {
    set_reference(target_of(instance, mr), static_cast<Instance*>(nullptr));
    return;
  }
  empty_references(targets_of(instance, mr));
  *null_flag(instance, mr) = 1;
}

/// Makes one requested feature non-null: 0, or -1 for a method.
int select_feature(Instance* instance, const Meta_Feature* f) {
  if (is_method(f)) return -1;
  if (is_scalar_reference(f)) {
    Instance*& target = target_of(instance, f);
    if (!target) target = create(as_reference(f)->meta_class, true);
  } else {
    *null_flag(instance, f) = 0;
  }
  return 0;
}

}  // namespace

void copy(Instance* dest, const Instance* src, const Instance* model) {
  const Meta_Record* record = src->meta_class;
  if (dest->meta_class != record || (model && model->meta_class != record)) return;
  for (std::uint64_t i = 0; i < record->num_meta_features; ++i) {
    const Meta_Feature* f = record->meta_features[i];
    if (!has_storage(f) || (model && is_null(model, f))) continue;
    copy_feature(dest, src, f);
  }
}

void copy_keys(Instance* dest, const Instance* src) {
  const Meta_Record* record = src->meta_class;
  if (dest->meta_class != record) return;
  for (std::uint64_t i = 0; i < record->num_meta_features; ++i)
    if (is_key(record->meta_features[i])) copy_feature(dest, src, record->meta_features[i]);
}

Instance* key_clone(const Instance* instance) {
  const Meta_Class* mc = class_of(instance);
  Instance* copy = mc ? create(mc, false) : create(as_method(instance->meta_class));
  nullify_properties(copy, true, true, true);
  copy_keys(copy, instance);
  return copy;
}

void nullify_properties(Instance* instance, bool include_keys, bool include_non_keys, bool value) {
  const Meta_Record* record = instance->meta_class;
  for (std::uint64_t i = 0; i < record->num_meta_features; ++i) {
    const Meta_Feature* f = record->meta_features[i];
    if (!is_property(f)) continue;
    if (is_key(f) ? include_keys : include_non_keys) *null_flag(instance, f) = value ? 1 : 0;
  }
}

void nullify_non_keys(Instance* instance) {
  nullify_properties(instance, false, true, true);
}

void clear(Instance* instance) {
  instance->__name_space.clear();
  const Meta_Record* record = instance->meta_class;
  for (std::uint64_t i = 0; i < record->num_meta_features; ++i) {
    const Meta_Feature* f = record->meta_features[i];
    if (is_property(f)) {
      clear_property(instance, as_property(f));
    } else if (is_reference(f)) {
      clear_reference(instance, as_reference(f));
    }
  }
}

int filter_properties(Instance* instance, const char* const* properties, bool keep_keys) {
  if (!properties) {
    nullify_properties(instance, true, true, false);
    return 0;
  }
  nullify_properties(instance, !keep_keys, true, true);
  for (; *properties; ++properties) {
    const Meta_Feature* f = find_feature(instance->meta_class, *properties, ANY_FEATURE);
    if (!f || is_key(f)) continue;
    if (select_feature(instance, f) != 0) return -1;
  }
  return 0;
}

}  // namespace cimrt
