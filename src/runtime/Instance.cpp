// Birth, copies and death of instances.
#include "runtime/Instance.h"

#include <cstring>
#include <new>

#include "runtime/Key_Features.h"

namespace cimrt {

constinit const Meta_Class Instance::static_meta_class = {
    {{0, FLAG_CLASS, "Instance", nullptr, 0}, nullptr, 0, sizeof(Instance)},
    nullptr,
    nullptr,
    0,
    nullptr};

namespace {

constexpr std::uint32_t DEAD_MAGIC = 0xDDDDDDDD;

using Instances = Array<Instance*>;

template <class T>
T& at(void* p) {
  return *static_cast<T*>(p);
}

const Array_Traits* element_traits(const Meta_Property* p) {
  return array_traits[p->type];
}

void construct_property(void* p, const Meta_Property* mp) {
  if (mp->subscript != 0) {
    ::new (p) Array_Base(element_traits(mp), nullptr, 0);  // takes room when something comes in
  } else if (mp->type == STRING) {
    ::new (p) String;
  } else if (mp->type == DATETIME) {
    ::new (p) Datetime;
  }
}

void construct_feature(Instance* instance, const Meta_Feature* f) {
  if (is_property(f)) {
    construct_property(storage(instance, f), as_property(f));
  } else if (is_reference(f) && as_reference(f)->subscript != 0) {
    ::new (storage(instance, f)) Instances;
  }
}

/// Default of an array: elements one by one; texts become strings or datetimes.
void apply_array_default(Array_Base& array, const Meta_Property* mp) {
  const Meta_Value* value = mp->value;
  const auto* texts = static_cast<const char* const*>(value->data);
  for (std::uint64_t i = 0; i < value->size; ++i) {
    if (mp->type == STRING) {
      const String text(texts[i]);
      array.append(&text, 1);
    } else if (mp->type == DATETIME) {
      const Datetime datetime(texts[i]);
      array.append(&datetime, 1);
    } else {
      array.append(static_cast<const char*>(value->data) + i * type_size_table[mp->type], 1);
    }
  }
}

void apply_default(Instance* instance, const Meta_Property* mp) {
  if (!mp->value) {
    *null_flag(instance, mp) = 1;
    return;
  }
  void* p = storage(instance, mp);
  if (mp->subscript != 0) {
    apply_array_default(at<Array_Base>(p), mp);
  } else if (mp->type == STRING) {
    at<String>(p).assign(static_cast<const char*>(mp->value->data));
  } else if (mp->type == DATETIME) {
    at<Datetime>(p).set(static_cast<const char*>(mp->value->data));
  } else {
    std::memcpy(p, mp->value->data, type_size_table[mp->type]);
  }
}

/// A record with its header filled; the bytes behind it are for the caller to set.
Instance* allocate(const Meta_Record* record) {
  void* block = ::operator new(record->size);
  auto* instance = static_cast<Instance*>(block);
  ref(record);
  instance->magic = INSTANCE_MAGIC;
  ::new (&instance->refs) std::atomic<std::uint32_t>(1);
  instance->meta_class = record;
  ::new (&instance->__name_space) String;
  return instance;
}

/// What stands behind the header: the storage of all features.
void* features_of(Instance* instance) {
  return instance + 1;
}

const void* features_of(const Instance* instance) {
  return instance + 1;
}

std::size_t features_size(const Meta_Record* record) {
  return record->size - sizeof(Instance);
}

void clone_property(void* to, const void* from, const Meta_Property* mp) {
  if (mp->subscript != 0) {
    ::new (to) Array_Base(*static_cast<const Array_Base*>(from));
  } else if (mp->type == STRING) {
    ::new (to) String(*static_cast<const String*>(from));
  } else if (mp->type == DATETIME) {
    ::new (to) Datetime(*static_cast<const Datetime*>(from));
  }
}

void release_property(void* p, const Meta_Property* mp) {
  if (mp->subscript != 0) {
    at<Array_Base>(p).~Array_Base();
  } else if (mp->type == STRING) {
    at<String>(p).~String();
  } else if (mp->type == DATETIME) {
    at<Datetime>(p).~Datetime();
  }
}

void release_reference(void* p, const Meta_Reference* mr) {
  if (mr->subscript == 0) {
    unref(at<Instance*>(p));
    return;
  }
  auto& elements = at<Instances>(p);
  for (Instance* element : elements) unref(element);
  elements.~Instances();
}

/// Takes down a record of which the first `made` features were constructed.
void take_down(Instance* instance, std::uint64_t made) {
  const Meta_Record* record = instance->meta_class;
  for (std::uint64_t i = 0; i < made; ++i) {
    const Meta_Feature* f = record->meta_features[i];
    if (is_property(f)) {
      release_property(storage(instance, f), as_property(f));
    } else if (is_reference(f)) {
      release_reference(storage(instance, f), as_reference(f));
    }
  }
  instance->__name_space.~String();
  instance->magic = DEAD_MAGIC;
  unref(record);
  ::operator delete(static_cast<void*>(instance));
}

Instance* create_record(const Meta_Record* record, bool defaults) {
  Instance* instance = allocate(record);
  std::memset(features_of(instance), 0, features_size(record));
  std::uint64_t made = 0;
  try {
    while (made < record->num_meta_features) {
      const Meta_Feature* f = record->meta_features[made];
      construct_feature(instance, f);
      ++made;
      if (defaults && is_property(f)) apply_default(instance, as_property(f));
    }
  } catch (...) {
    take_down(instance, made);
    throw;
  }
  return instance;
}

void clone_reference(void* to, const void* from, const Meta_Reference* mr) {
  if (mr->subscript == 0) {
    at<Instance*>(to) = clone_or_null(*static_cast<Instance* const*>(from));
    return;
  }
  const auto& source = *static_cast<const Instances*>(from);
  auto* copy = ::new (to) Instances;
  try {
    copy->reserve(source.size());
    for (const Instance* element : source) copy->append(clone_or_null(element));
  } catch (...) {
    release_reference(to, mr);
    throw;
  }
}

void clone_feature(Instance* copy, const Instance* instance, const Meta_Feature* f) {
  if (is_property(f)) {
    clone_property(storage(copy, f), storage(instance, f), as_property(f));
  } else if (is_reference(f)) {
    clone_reference(storage(copy, f), storage(instance, f), as_reference(f));
  }
}

}  // namespace

const Meta_Class* class_of(const Instance* instance) {
  const Meta_Record* record = instance->meta_class;
  return is_method(record) ? nullptr : static_cast<const Meta_Class*>(record);
}

Instance* create(const Meta_Class* meta_class, bool defaults) {
  return create_record(meta_class, defaults);
}

Instance* create(const Meta_Method* meta_method) {
  return create_record(meta_method, true);
}

Instance* clone(const Instance* instance) {
  const Meta_Record* record = instance->meta_class;
  Instance* copy = allocate(record);
  copy->__name_space = instance->__name_space;
  std::memcpy(features_of(copy), features_of(instance), features_size(record));
  std::uint64_t made = 0;
  try {
    for (; made < record->num_meta_features; ++made)
      clone_feature(copy, instance, record->meta_features[made]);
  } catch (...) {
    take_down(copy, made);
    throw;
  }
  return copy;
}

void destroy(Instance* instance) {
  if (instance) take_down(instance, instance->meta_class->num_meta_features);
}

void ref(Instance* instance) {
  if (instance) instance->refs.fetch_add(1, std::memory_order_relaxed);
}

void unref(Instance* instance) {
  if (instance && instance->refs.fetch_sub(1, std::memory_order_acq_rel) == 1) destroy(instance);
}

void* storage(Instance* instance, const Meta_Feature* feature) {
  const std::uint32_t offset =
      is_property(feature) ? as_property(feature)->offset : as_reference(feature)->offset;
  return reinterpret_cast<char*>(instance) + offset;
}

const void* storage(const Instance* instance, const Meta_Feature* feature) {
  return storage(const_cast<Instance*>(instance), feature);
}

std::uint8_t* null_flag(Instance* instance, const Meta_Feature* feature) {
  std::size_t width = 0;
  if (is_property(feature)) {
    const Meta_Property* p = as_property(feature);
    width = p->subscript != 0 ? sizeof(Array_Base) : type_size_table[p->type];
  } else if (is_reference(feature) && as_reference(feature)->subscript != 0) {
    width = sizeof(Array_Base);
  } else {
    return nullptr;
  }
  return static_cast<std::uint8_t*>(storage(instance, feature)) + width;
}

const std::uint8_t* null_flag(const Instance* instance, const Meta_Feature* feature) {
  return null_flag(const_cast<Instance*>(instance), feature);
}

}  // namespace cimrt
