// Structural comparison of class descriptions.
#include <cstring>

#include "runtime/Meta_Class.h"

namespace cimrt {
namespace {

bool text_eq(const char* a, const char* b) {
  return a && b ? std::strcmp(a, b) == 0 : a == b;
}

bool is_text(int type) {
  return type == STRING || type == DATETIME;
}

bool value_eq(const Meta_Value* a, const Meta_Value* b, int type, bool is_array) {
  if (!a || !b) return a == b;
  if (!a->data || !b->data) return a->data == b->data && a->size == b->size;
  if (!is_array && is_text(type))
    return text_eq(static_cast<const char*>(a->data), static_cast<const char*>(b->data));
  if (!is_array) return std::memcmp(a->data, b->data, type_size_table[type]) == 0;
  if (a->size != b->size) return false;
  if (!is_text(type)) return std::memcmp(a->data, b->data, a->size * type_size_table[type]) == 0;
  const auto* xs = static_cast<const char* const*>(a->data);
  const auto* ys = static_cast<const char* const*>(b->data);
  for (std::uint64_t i = 0; i < a->size; ++i)
    if (!text_eq(xs[i], ys[i])) return false;
  return true;
}

bool qualifier_eq(const Meta_Qualifier* a, const Meta_Qualifier* b) {
  return name_eq(a->name, b->name) && a->type == b->type && a->subscript == b->subscript &&
         value_eq(a->value, b->value, a->type, a->subscript != 0);
}

bool head_eq(const Meta_Feature* a, const Meta_Feature* b) {
  if (a->flags != b->flags || !name_eq(a->name, b->name) ||
      a->num_meta_qualifiers != b->num_meta_qualifiers)
    return false;
  for (std::uint64_t i = 0; i < a->num_meta_qualifiers; ++i)
    if (!qualifier_eq(a->meta_qualifiers[i], b->meta_qualifiers[i])) return false;
  return true;
}

bool property_eq(const Meta_Property* a, const Meta_Property* b) {
  return a->type == b->type && a->subscript == b->subscript && a->offset == b->offset &&
         value_eq(a->value, b->value, a->type, a->subscript != 0);
}

/// Classes of references are compared by name: they may refer back to the class that is compared.
bool reference_eq(const Meta_Reference* a, const Meta_Reference* b) {
  return a->subscript == b->subscript && a->offset == b->offset &&
         name_eq(a->meta_class->name, b->meta_class->name);
}

bool record_eq(const Meta_Record* a, const Meta_Record* b);

bool feature_eq(const Meta_Feature* a, const Meta_Feature* b) {
  if (!head_eq(a, b)) return false;
  if (is_property(a)) return property_eq(as_property(a), as_property(b));
  if (is_reference(a)) return reference_eq(as_reference(a), as_reference(b));
  const Meta_Method* m = as_method(a);
  const Meta_Method* n = as_method(b);
  return m->return_type == n->return_type && record_eq(m, n);
}

bool record_eq(const Meta_Record* a, const Meta_Record* b) {
  if (a->size != b->size || a->num_meta_features != b->num_meta_features) return false;
  for (std::uint64_t i = 0; i < a->num_meta_features; ++i)
    if (!feature_eq(a->meta_features[i], b->meta_features[i])) return false;
  return true;
}

bool locals_eq(const Meta_Class* a, const Meta_Class* b) {
  if (!a->locals || !b->locals) return a->locals == b->locals || a->num_meta_features == 0;
  return a->num_meta_features == 0 || std::memcmp(a->locals, b->locals, a->num_meta_features) == 0;
}

}  // namespace

bool identical(const Meta_Class* a, const Meta_Class* b) {
  if (!a || !b || a == b) return a == b;
  return head_eq(a, b) && record_eq(a, b) && a->num_keys == b->num_keys && locals_eq(a, b) &&
         identical(a->super_meta_class, b->super_meta_class);
}

}  // namespace cimrt
