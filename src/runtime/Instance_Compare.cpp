// Comparing instances, by keys across classes and as a whole.
#include <cstring>

#include "runtime/Instance.h"
#include "runtime/Key_Features.h"

namespace cimrt {
namespace {

using Instances = Array<Instance*>;

template <class T>
const T& at(const void* p) {
  return *static_cast<const T*>(p);
}

bool scalar_eq(const void* a, const void* b, std::uint16_t type) {
  switch (type) {
    case REAL32:
      return at<float>(a) == at<float>(b);
    case REAL64:
      return at<double>(a) == at<double>(b);
    case STRING:
      return at<String>(a).equal(at<String>(b));
    case DATETIME:
      return at<Datetime>(a).equal(at<Datetime>(b));
    default:
      return std::memcmp(a, b, type_size_table[type]) == 0;
  }
}

bool key_eq_or_null(const Instance* a, const Instance* b) {
  return a && b ? key_eq(a, b) : a == b;
}

bool identical_or_null(const Instance* a, const Instance* b) {
  return a && b ? identical(a, b) : a == b;
}

/// Compares two reference fields of one kind, targets by `equal`.
bool reference_eq(const Instance* a, const Meta_Reference* mra, const Instance* b,
                  const Meta_Reference* mrb, bool (*equal)(const Instance*, const Instance*)) {
  const void* pa = storage(a, mra);
  const void* pb = storage(b, mrb);
  if (mra->subscript == 0) return equal(at<Instance*>(pa), at<Instance*>(pb));
  const auto& xs = at<Instances>(pa);
  const auto& ys = at<Instances>(pb);
  if (null_differs(a, mra, b, mrb) || xs.size() != ys.size()) return false;
  for (std::size_t i = 0; i < xs.size(); ++i)
    if (!equal(xs[i], ys[i])) return false;
  return true;
}

bool key_feature_eq(const Instance* a, const Meta_Feature* f, const Instance* b) {
  const Meta_Feature* g = matching_key(f, b->meta_class);
  if (!g) return false;
  if (is_property(f)) return property_eq(a, as_property(f), b, as_property(g));
  return reference_eq(a, as_reference(f), b, as_reference(g), key_eq_or_null);
}

bool feature_identical(const Instance* a, const Instance* b, const Meta_Feature* f) {
  if (is_property(f)) return property_eq(a, as_property(f), b, as_property(f));
  if (!is_reference(f)) return true;
  return reference_eq(a, as_reference(f), b, as_reference(f), identical_or_null);
}

}  // namespace

bool null_differs(const Instance* a, const Meta_Feature* fa, const Instance* b,
                  const Meta_Feature* fb) {
  return (*null_flag(a, fa) != 0) != (*null_flag(b, fb) != 0);
}

bool property_eq(const Instance* a, const Meta_Property* pa, const Instance* b,
                 const Meta_Property* pb) {
  if (null_differs(a, pa, b, pb)) return false;
  const void* x = storage(a, pa);
  const void* y = storage(b, pb);
  return pa->subscript != 0 ? at<Array_Base>(x).equal(at<Array_Base>(y))
                            : scalar_eq(x, y, pa->type);
}

const Meta_Feature* matching_key(const Meta_Feature* key, const Meta_Record* record) {
  if (is_property(key)) {
    const Meta_Property* p = as_property(key);
    const Meta_Property* q = find_property(record, key->name);
    return q && is_key(q) && q->type == p->type && q->subscript == p->subscript ? q : nullptr;
  }
  const Meta_Reference* p = as_reference(key);
  const Meta_Reference* q = find_reference(record, key->name);
  if (!q || !is_key(q) || (p->subscript != 0) != (q->subscript != 0)) return nullptr;
  const bool related =
      is_subclass(p->meta_class, q->meta_class) || is_subclass(q->meta_class, p->meta_class);
  return related ? q : nullptr;
}

bool key_eq(const Instance* a, const Instance* b) {
  if (!a || !b) return a == b;
  const Meta_Record* record = a->meta_class;
  for (std::uint64_t i = 0; i < record->num_meta_features; ++i) {
    const Meta_Feature* f = record->meta_features[i];
    if (is_key(f) && !is_method(f) && !key_feature_eq(a, f, b)) return false;
  }
  return true;
}

bool identical(const Instance* a, const Instance* b) {
  if (a->meta_class != b->meta_class || !a->__name_space.equal(b->__name_space)) return false;
  const Meta_Record* record = a->meta_class;
  for (std::uint64_t i = 0; i < record->num_meta_features; ++i)
    if (!feature_identical(a, b, record->meta_features[i])) return false;
  return true;
}

bool keys_non_null(const Instance* instance) {
  const Meta_Record* record = instance->meta_class;
  for (std::uint64_t i = 0; i < record->num_meta_features; ++i) {
    const Meta_Feature* f = record->meta_features[i];
    if (is_key(f) && !is_method(f) && is_null(instance, f)) return false;
  }
  return true;
}

}  // namespace cimrt
