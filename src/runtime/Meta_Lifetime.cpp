// Class descriptions made at run time: creation, deep copies, counting and destruction. Static
// descriptions have count 0 and are left alone by all of it.
#include <cstring>
#include <new>
#include <vector>

#include "runtime/Instance.h"
#include "runtime/Meta_Class.h"

namespace cimrt {
namespace {

constexpr unsigned char DEAD_BYTE = 0xDD;

/// Overwrites an object with the dead pattern and frees it, so that use after the end shows up.
template <class T>
void bury(T* object) {
  std::memset(static_cast<void*>(object), DEAD_BYTE, sizeof(T));
  asm volatile("" : : "r"(object) : "memory");  // keeps the pattern from being optimised away
  ::operator delete(object);
}

template <class T>
T* allocate_zeroed() {
  void* block = ::operator new(sizeof(T));
  std::memset(block, 0, sizeof(T));
  T* object = ::new (block) T{};
  object->refs.store(1, std::memory_order_relaxed);
  return object;
}

char* copy_text(const char* text) {
  const std::size_t n = std::strlen(text) + 1;
  auto* copy = static_cast<char*>(::operator new(n));
  std::memcpy(copy, text, n);
  return copy;
}

void free_block(const void* block) {
  ::operator delete(const_cast<void*>(block));
}

bool holds_texts(int type) {
  return type == STRING || type == DATETIME;
}

Meta_Value* clone_value(const Meta_Value* value, int type, bool is_array) {
  if (!value) return nullptr;
  auto* copy = ::new Meta_Value{nullptr, value->size};
  if (!value->data) return copy;
  if (!is_array && holds_texts(type)) {
    copy->data = copy_text(static_cast<const char*>(value->data));
  } else if (holds_texts(type)) {
    const auto* from = static_cast<const char* const*>(value->data);
    auto* to = static_cast<const char**>(::operator new(value->size * sizeof(char*)));
    for (std::uint64_t i = 0; i < value->size; ++i) to[i] = from[i] ? copy_text(from[i]) : nullptr;
    copy->data = to;
  } else {
    const std::size_t n = type_size_table[type] * (is_array ? value->size : 1);
    void* to = ::operator new(n);
    if (n != 0) std::memcpy(to, value->data, n);
    copy->data = to;
  }
  return copy;
}

void destroy_value(const Meta_Value* value, int type, bool is_array) {
  if (!value) return;
  if (is_array && holds_texts(type) && value->data) {
    const auto* texts = static_cast<const char* const*>(value->data);
    for (std::uint64_t i = 0; i < value->size; ++i) free_block(texts[i]);
  }
  free_block(value->data);
  delete value;
}

void destroy(Meta_Qualifier* qualifier) {
  free_block(qualifier->name);
  destroy_value(qualifier->value, qualifier->type, qualifier->subscript != 0);
  bury(qualifier);
}

void unref_qualifier(const Meta_Qualifier* qualifier) {
  if (qualifier->refs.load(std::memory_order_relaxed) == 0) return;
  if (qualifier->refs.fetch_sub(1, std::memory_order_acq_rel) == 1)
    destroy(const_cast<Meta_Qualifier*>(qualifier));
}

template <class T>
void set_list(const T* const*& list, std::uint64_t& n, const std::vector<const T*>& items) {
  free_block(list);
  n = items.size();
  list = nullptr;
  if (items.empty()) return;
  auto* copy = static_cast<const T**>(::operator new(n * sizeof(T*)));
  std::memcpy(copy, items.data(), n * sizeof(T*));
  list = copy;
}

/// Copies the head; name and qualifiers become the copy's own.
void clone_head(Meta_Feature* to, const Meta_Feature* from) {
  to->flags = from->flags;
  to->name = copy_text(from->name);
  std::vector<const Meta_Qualifier*> qualifiers;
  for (std::uint64_t i = 0; i < from->num_meta_qualifiers; ++i)
    qualifiers.push_back(clone(from->meta_qualifiers[i]));
  set_list(to->meta_qualifiers, to->num_meta_qualifiers, qualifiers);
}

void destroy_head(Meta_Feature* feature) {
  for (std::uint64_t i = 0; i < feature->num_meta_qualifiers; ++i)
    unref_qualifier(feature->meta_qualifiers[i]);
  free_block(feature->meta_qualifiers);
  free_block(feature->name);
}

void clone_features(Meta_Record* to, const Meta_Record* from) {
  std::vector<const Meta_Feature*> features;
  for (std::uint64_t i = 0; i < from->num_meta_features; ++i)
    features.push_back(clone(from->meta_features[i]));
  set_list(to->meta_features, to->num_meta_features, features);
  to->size = from->size;
}

void destroy_features(Meta_Record* record) {
  for (std::uint64_t i = 0; i < record->num_meta_features; ++i) unref(record->meta_features[i]);
  free_block(record->meta_features);
}

Meta_Property* clone_property(const Meta_Property* from) {
  auto* to = allocate_zeroed<Meta_Property>();
  clone_head(to, from);
  to->type = from->type;
  to->subscript = from->subscript;
  to->offset = from->offset;
  to->value = clone_value(from->value, from->type, from->subscript != 0);
  return to;
}

Meta_Reference* clone_reference(const Meta_Reference* from) {
  auto* to = allocate_zeroed<Meta_Reference>();
  clone_head(to, from);
  to->subscript = from->subscript;
  to->offset = from->offset;
  to->meta_class = from->meta_class;
  ref(to->meta_class);
  return to;
}

Meta_Method* clone_method(const Meta_Method* from) {
  auto* to = allocate_zeroed<Meta_Method>();
  clone_head(to, from);
  clone_features(to, from);
  to->return_type = from->return_type;
  return to;
}

void destroy_property(Meta_Property* property) {
  destroy_value(property->value, property->type, property->subscript != 0);
  destroy_head(property);
  bury(property);
}

void destroy_reference(Meta_Reference* reference) {
  unref(reference->meta_class);
  destroy_head(reference);
  bury(reference);
}

void destroy_method(Meta_Method* method) {
  destroy_features(method);
  destroy_head(method);
  bury(method);
}

void destroy_class(Meta_Class* meta_class) {
  destroy_features(meta_class);
  free_block(meta_class->locals);
  unref(meta_class->super_meta_class);
  destroy_head(meta_class);
  bury(meta_class);
}

void destroy_feature(Meta_Feature* feature) {
  if (is_property(feature)) {
    destroy_property(static_cast<Meta_Property*>(feature));
  } else if (is_reference(feature)) {
    destroy_reference(static_cast<Meta_Reference*>(feature));
  } else if (is_method(feature)) {
    destroy_method(static_cast<Meta_Method*>(feature));
  } else {
    destroy_class(static_cast<Meta_Class*>(feature));
  }
}

bool is_listed(const char* name, const char* const* names, std::size_t n) {
  if (!names) return true;
  for (std::size_t i = 0; i < n; ++i)
    if (name_eq(names[i], name)) return true;
  return false;
}

void filter_own_qualifiers(Meta_Feature* feature, const char* const* names, std::size_t n) {
  std::vector<const Meta_Qualifier*> kept;
  for (std::uint64_t i = 0; i < feature->num_meta_qualifiers; ++i) {
    const Meta_Qualifier* q = feature->meta_qualifiers[i];
    if (is_listed(q->name, names, n)) {
      unref_qualifier(q);
    } else {
      kept.push_back(q);
    }
  }
  set_list(feature->meta_qualifiers, feature->num_meta_qualifiers, kept);
}

bool is_static(const Meta_Feature* feature) {
  return feature->refs.load(std::memory_order_relaxed) == 0;
}

void filter_record(Meta_Record* record, const char* const* names, std::size_t n) {
  if (is_static(record)) return;
  filter_own_qualifiers(record, names, n);
  for (std::uint64_t i = 0; i < record->num_meta_features; ++i) {
    auto* feature = const_cast<Meta_Feature*>(record->meta_features[i]);
    if (is_method(feature)) filter_record(static_cast<Meta_Method*>(feature), names, n);
  }
}

std::uint8_t* copy_locals(const std::uint8_t* locals, std::uint64_t n) {
  auto* copy = static_cast<std::uint8_t*>(::operator new(n + 1));
  std::memset(copy, 0, n + 1);
  if (locals && n != 0) std::memcpy(copy, locals, n);
  return copy;
}

/// End of a feature's storage by the layout rule; methods take none.
std::uint32_t storage_end(const Meta_Feature* feature) {
  constexpr std::uint32_t array_width = 16;
  if (is_property(feature)) {
    const Meta_Property* p = as_property(feature);
    const auto width = static_cast<std::uint32_t>(type_size_table[p->type]);
    return p->offset + (p->subscript != 0 ? array_width : 2 * width);
  }
  if (is_reference(feature)) {
    const Meta_Reference* r = as_reference(feature);
    return r->offset +
           (r->subscript != 0 ? array_width : static_cast<std::uint32_t>(sizeof(void*)));
  }
  return 0;
}

}  // namespace

void ref(const Meta_Feature* feature) {
  if (!feature || is_static(feature)) return;
  feature->refs.fetch_add(1, std::memory_order_relaxed);
}

void unref(const Meta_Feature* feature) {
  if (!feature || is_static(feature)) return;
  if (feature->refs.fetch_sub(1, std::memory_order_acq_rel) == 1)
    destroy_feature(const_cast<Meta_Feature*>(feature));
}

Meta_Qualifier* clone(const Meta_Qualifier* qualifier) {
  auto* copy = allocate_zeroed<Meta_Qualifier>();
  copy->name = copy_text(qualifier->name);
  copy->type = qualifier->type;
  copy->subscript = qualifier->subscript;
  copy->value = clone_value(qualifier->value, qualifier->type, qualifier->subscript != 0);
  return copy;
}

Meta_Feature* clone(const Meta_Feature* feature) {
  if (is_property(feature)) return clone_property(as_property(feature));
  if (is_reference(feature)) return clone_reference(as_reference(feature));
  if (is_method(feature)) return clone_method(as_method(feature));
  return clone(static_cast<const Meta_Class*>(feature));
}

Meta_Class* clone(const Meta_Class* meta_class) {
  auto* copy = allocate_zeroed<Meta_Class>();
  clone_head(copy, meta_class);
  clone_features(copy, meta_class);
  copy->locals = copy_locals(meta_class->locals, meta_class->num_meta_features);
  copy->super_meta_class = meta_class->super_meta_class;
  ref(copy->super_meta_class);
  copy->num_keys = meta_class->num_keys;
  return copy;
}

void destroy(Meta_Class* meta_class) {
  if (!is_static(meta_class)) destroy_class(meta_class);
}

Meta_Class* create_meta_class(const char* name, const Meta_Class* super, std::uint32_t flags) {
  if (!super) {
    auto* mc = allocate_zeroed<Meta_Class>();
    mc->flags = flags;
    mc->name = copy_text(name);
    mc->size = sizeof(Instance);
    mc->locals = copy_locals(nullptr, 0);
    return mc;
  }
  Meta_Class* mc = clone(super);
  mc->flags &= ~static_cast<std::uint32_t>(FLAG_ABSTRACT);
  const char* const abstract[] = {"Abstract"};
  filter_own_qualifiers(mc, abstract, 1);
  free_block(mc->name);
  mc->name = copy_text(name);
  std::memset(const_cast<std::uint8_t*>(mc->locals), 0, mc->num_meta_features);
  ref(super);
  unref(mc->super_meta_class);
  mc->super_meta_class = super;
  return mc;
}

Meta_Property* create_property(const char* name, Type type, std::int16_t subscript,
                               std::uint32_t offset, bool key) {
  auto* p = allocate_zeroed<Meta_Property>();
  p->flags = FLAG_PROPERTY | FLAG_READ | (key ? std::uint32_t{FLAG_KEY} : 0u);
  p->name = copy_text(name);
  p->type = static_cast<std::uint16_t>(type);
  p->subscript = subscript;
  p->offset = offset;
  return p;
}

void add_feature(Meta_Class* meta_class, Meta_Feature* feature) {
  const std::uint64_t n = meta_class->num_meta_features;
  std::vector<const Meta_Feature*> features(meta_class->meta_features,
                                            meta_class->meta_features + n);
  features.push_back(feature);
  std::uint8_t* locals = copy_locals(nullptr, n + 1);
  if (n != 0) std::memcpy(locals, meta_class->locals, n);
  locals[n] = 1;
  free_block(meta_class->locals);
  meta_class->locals = locals;
  set_list(meta_class->meta_features, meta_class->num_meta_features, features);
  if ((feature->flags & FLAG_KEY) != 0) ++meta_class->num_keys;
  const std::uint32_t end = (storage_end(feature) + 7u) & ~7u;
  if (end > meta_class->size) meta_class->size = end;
}

void add_qualifier(Meta_Feature* feature, Meta_Qualifier* qualifier) {
  std::vector<const Meta_Qualifier*> qualifiers(
      feature->meta_qualifiers, feature->meta_qualifiers + feature->num_meta_qualifiers);
  qualifiers.push_back(qualifier);
  set_list(feature->meta_qualifiers, feature->num_meta_qualifiers, qualifiers);
}

void filter_qualifiers(Meta_Class* meta_class, const char* const* names, std::size_t n) {
  filter_record(meta_class, names, n);
}

}  // namespace cimrt
