// Look-ups in class descriptions. All scans are linear and in order; the first match wins.
#include "runtime/Meta_Class.h"

#include "runtime/Instance.h"

namespace cimrt {

constinit const char* const flag_names[32] = {
    "Property",
    "Reference",
    "Method",
    "Class",
    "Abstract",
    "Aggregate",
    "Aggregation",
    "Association",
    "Composition",
    "Counter",
    "Delete",
    "DN",
    "EmbeddedObject",
    "Exception",
    "Expensive",
    "Experimental",
    "Gauge",
    "IfDeleted",
    "In",
    "Indication",
    "Invisible",
    "Key",
    "Large",
    "OctetString",
    "Out",
    "Read",
    "Required",
    "Static",
    "Terminal",
    "Weak",
    "Write",
    "EmbeddedInstance",
};

const Meta_Class* find_meta_class(const Meta_Repository* repository, const char* name) {
  if (!repository || !name) return nullptr;
  for (std::uint64_t i = 0; i < repository->num_meta_classes; ++i) {
    const Meta_Class* mc = repository->meta_classes[i];
    if (name_eq(mc->name, name)) return mc;
  }
  return nullptr;
}

const Meta_Feature* find_feature(const Meta_Record* record, const char* name, std::uint32_t mask) {
  for (std::uint64_t i = 0; i < record->num_meta_features; ++i) {
    const Meta_Feature* f = record->meta_features[i];
    if ((f->flags & mask) != 0 && name_eq(f->name, name)) return f;
  }
  return nullptr;
}

const Meta_Property* find_property(const Meta_Record* record, const char* name) {
  return static_cast<const Meta_Property*>(find_feature(record, name, FLAG_PROPERTY));
}

const Meta_Reference* find_reference(const Meta_Record* record, const char* name) {
  return static_cast<const Meta_Reference*>(find_feature(record, name, FLAG_REFERENCE));
}

const Meta_Method* find_method(const Meta_Record* record, const char* name) {
  return static_cast<const Meta_Method*>(find_feature(record, name, FLAG_METHOD));
}

bool is_subclass(const Meta_Class* ancestor, const Meta_Class* meta_class) {
  if (!ancestor) return false;
  if (ancestor == &Instance::static_meta_class ||
      name_eq(ancestor->name, Instance::static_meta_class.name))
    return true;
  for (const Meta_Class* mc = meta_class; mc; mc = mc->super_meta_class)
    if (mc == ancestor || name_eq(mc->name, ancestor->name)) return true;
  return false;
}

int is_subclass(const Meta_Repository* repository, const char* super_name, const char* sub_name) {
  if (!repository || !super_name || !sub_name) return -1;
  const Meta_Class* ancestor = find_meta_class(repository, super_name);
  const Meta_Class* meta_class = find_meta_class(repository, sub_name);
  if (!ancestor || !meta_class) return -1;
  return is_subclass(ancestor, meta_class) ? 0 : 1;
}

const Meta_Class* find_dependent(const Meta_Class* meta_class, const char* name) {
  for (const Meta_Class* mc = meta_class; mc; mc = mc->super_meta_class)
    if (name_eq(mc->name, name)) return mc;
  return meta_class ? find_meta_class(meta_class->meta_repository, name) : nullptr;
}

bool has_feature(const Meta_Record* record, std::uint32_t mask) {
  for (std::uint64_t i = 0; i < record->num_meta_features; ++i)
    if ((record->meta_features[i]->flags & mask) != 0) return true;
  return false;
}

}  // namespace cimrt
