// Walks over an instance and what it refers to, and the tests of association walks.
#include "runtime/Instance.h"
#include "runtime/Key_Features.h"

namespace cimrt {
namespace {

struct Name_Space_Request {
  const char* name_space;
  bool force;
};

void apply_name_space(Instance* instance, void* data) {
  const auto* request = static_cast<const Name_Space_Request*>(data);
  if (request->force || instance->__name_space.empty())
    instance->__name_space.assign(request->name_space);
}

/// True if this reference of an association points at `instance`, judged by class and keys.
bool points_at(const Meta_Reference* mr, const Instance* target, const Instance* instance) {
  return target && is_subclass(mr->meta_class, class_of(instance)) && key_eq(instance, target);
}

bool has_role(const Meta_Feature* feature, const String& role) {
  return role.empty() || name_eq(feature->name, role.c_str());
}

bool has_class_name(const Instance* target, const String& name) {
  if (name.empty()) return true;
  for (const Meta_Class* mc = class_of(target); mc; mc = mc->super_meta_class)
    if (name_eq(mc->name, name.c_str())) return true;
  return false;
}

}  // namespace

void create_sub_objects(Instance* instance) {
  const Meta_Record* record = instance->meta_class;
  for (std::uint64_t i = 0; i < record->num_meta_features; ++i) {
    const Meta_Feature* f = record->meta_features[i];
    if (is_scalar_reference(f) && !target_of(instance, f))
      target_of(instance, f) = create(as_reference(f)->meta_class, true);
  }
}

void __visit(Instance* instance, void (*proc)(Instance* instance, void* data), void* data) {
  proc(instance, data);
  const Meta_Record* record = instance->meta_class;
  for (std::uint64_t i = 0; i < record->num_meta_features; ++i) {
    const Meta_Feature* f = record->meta_features[i];
    if (is_scalar_reference(f)) {
      if (target_of(instance, f)) __visit(target_of(instance, f), proc, data);
    } else if (is_reference(f)) {
      for (Instance* element : targets_of(instance, f))
        if (element) __visit(element, proc, data);
    }
  }
}

void set_name_space(Instance* instance, const char* name_space, bool force) {
  Name_Space_Request request{name_space, force};
  __visit(instance, apply_name_space, &request);
}

bool is_reference_of(const Instance* instance, const Instance* association, const String& role) {
  const Meta_Record* record = association->meta_class;
  for (std::uint64_t i = 0; i < record->num_meta_features; ++i) {
    const Meta_Feature* f = record->meta_features[i];
    if (is_scalar_reference(f) && has_role(f, role) &&
        points_at(as_reference(f), target_of(association, f), instance))
      return true;
  }
  return false;
}

int get_associators(const Instance* instance, const Instance* association,
                    const String& result_class, const String& role, const String& result_role,
                    Instance** results) {
  bool matched = false;
  int found = 0;
  const Meta_Record* record = association->meta_class;
  for (std::uint64_t i = 0; i < record->num_meta_features; ++i) {
    const Meta_Feature* f = record->meta_features[i];
    if (!is_scalar_reference(f)) continue;
    auto* target = const_cast<Instance*>(target_of(association, f));
    if (points_at(as_reference(f), target, instance)) {
      matched = matched || has_role(f, role);
    } else if (target && has_class_name(target, result_class) && has_role(f, result_role) &&
               found < MAX_ASSOCIATORS) {
      results[found++] = target;
    }
  }
  return matched ? found : -1;
}

}  // namespace cimrt
