// Constant descriptions of CIM classes; all generic work on instances walks them.
#pragma once

#include <atomic>
#include <cstddef>
#include <cstdint>

#include "runtime/Types.h"

namespace cimrt {

struct Meta_Class;
struct Meta_Repository;

/// Flag bits of classes and features, by CIM qualifier of the same name.
enum Meta_Flag : std::uint32_t {
  FLAG_PROPERTY = 1u << 0,
  FLAG_REFERENCE = 1u << 1,
  FLAG_METHOD = 1u << 2,
  FLAG_CLASS = 1u << 3,
  FLAG_ABSTRACT = 1u << 4,
  FLAG_AGGREGATE = 1u << 5,
  FLAG_AGGREGATION = 1u << 6,
  FLAG_ASSOCIATION = 1u << 7,
  FLAG_COMPOSITION = 1u << 8,
  FLAG_COUNTER = 1u << 9,
  FLAG_DELETE = 1u << 10,
  FLAG_DN = 1u << 11,
  FLAG_EMBEDDED_OBJECT = 1u << 12,
  FLAG_EXCEPTION = 1u << 13,
  FLAG_EXPENSIVE = 1u << 14,
  FLAG_EXPERIMENTAL = 1u << 15,
  FLAG_GAUGE = 1u << 16,
  FLAG_IF_DELETED = 1u << 17,
  FLAG_IN = 1u << 18,
  FLAG_INDICATION = 1u << 19,
  FLAG_INVISIBLE = 1u << 20,
  FLAG_KEY = 1u << 21,
  FLAG_LARGE = 1u << 22,
  FLAG_OCTET_STRING = 1u << 23,
  FLAG_OUT = 1u << 24,
  FLAG_READ = 1u << 25,
  FLAG_REQUIRED = 1u << 26,
  FLAG_STATIC = 1u << 27,
  FLAG_TERMINAL = 1u << 28,
  FLAG_WEAK = 1u << 29,
  FLAG_WRITE = 1u << 30,
  FLAG_EMBEDDED_INSTANCE = 1u << 31,
};

/// Mask of every kind of feature in `find_feature`.
inline constexpr std::uint32_t ANY_FEATURE = FLAG_PROPERTY | FLAG_REFERENCE | FLAG_METHOD;

/// Qualifier name of each flag bit ("Property", "Reference", ...).
extern const char* const flag_names[32];

/// Constant default. A scalar of a plain type points at the bytes of the value, a string or
/// datetime at its text; an array at its elements (texts for string and datetime) with their count.
struct Meta_Value {
  const void* data;
  std::uint64_t size;  ///< element count of an array, 1 for a scalar
};

struct Meta_Qualifier {
  mutable std::atomic<std::uint32_t> refs;
  const char* name;
  std::int8_t type;
  std::int8_t subscript;  ///< non-zero: an array
  const Meta_Value* value;
};

/// Head of every description. `refs` is 0 for static data, which is never counted and never freed.
struct Meta_Feature {
  mutable std::atomic<std::uint32_t> refs;
  std::uint32_t flags;
  const char* name;
  const Meta_Qualifier* const* meta_qualifiers;
  std::uint64_t num_meta_qualifiers;
};

struct Meta_Property : Meta_Feature {
  std::uint16_t type;       ///< `Type` code 0 to 13
  std::int16_t subscript;   ///< 0 scalar, -1 variable-length array, positive fixed-length array
  std::uint32_t offset;     ///< position of the storage in the record
  const Meta_Value* value;  ///< default, may be null
};

struct Meta_Reference : Meta_Feature {
  std::int16_t subscript;  ///< 0 scalar, otherwise array of references
  const Meta_Class* meta_class;
  std::uint32_t offset;
};

/// What a class and a method have in common: features and the size of the record they lay out.
struct Meta_Record : Meta_Feature {
  const Meta_Feature* const* meta_features;  ///< inherited ones first
  std::uint64_t num_meta_features;
  std::uint32_t size;  ///< bytes of an instance (or of a method call record)
};

/// A method; its features are the parameters and, last, "return_value".
struct Meta_Method : Meta_Record {
  std::uint16_t return_type;  ///< `Type` code
};

struct Meta_Class : Meta_Record {
  const std::uint8_t* locals;  ///< per feature: 1 if introduced or overridden here
  const Meta_Class* super_meta_class;
  std::uint64_t num_keys;
  const Meta_Repository* meta_repository;
};

struct Meta_Repository {
  const Meta_Class* const* meta_classes;
  std::uint64_t num_meta_classes;
};

inline bool is_property(const Meta_Feature* f) {
  return (f->flags & FLAG_PROPERTY) != 0;
}
inline bool is_reference(const Meta_Feature* f) {
  return (f->flags & FLAG_REFERENCE) != 0;
}
inline bool is_method(const Meta_Feature* f) {
  return (f->flags & FLAG_METHOD) != 0;
}
inline const Meta_Property* as_property(const Meta_Feature* f) {
  return static_cast<const Meta_Property*>(f);
}
inline const Meta_Reference* as_reference(const Meta_Feature* f) {
  return static_cast<const Meta_Reference*>(f);
}
inline const Meta_Method* as_method(const Meta_Feature* f) {
  return static_cast<const Meta_Method*>(f);
}

/// Names are compared ignoring case, everywhere. Look-ups are linear; the first match wins; null
/// when nothing matches. Meta data is immutable: any thread may read it without a lock.

/// A null repository answers null.
const Meta_Class* find_meta_class(const Meta_Repository* repository, const char* name);
/// First feature of that name whose flags share a bit with `mask`.
const Meta_Feature* find_feature(const Meta_Record* record, const char* name,
                                 std::uint32_t mask = ANY_FEATURE);
const Meta_Property* find_property(const Meta_Record* record, const char* name);
const Meta_Reference* find_reference(const Meta_Record* record, const char* name);
const Meta_Method* find_method(const Meta_Record* record, const char* name);
/// True if `meta_class` is `ancestor` or descends from it, by pointer or by name: a class made at
/// run time counts as the class it copies. Everything, null too, descends from `Instance`.
bool is_subclass(const Meta_Class* ancestor, const Meta_Class* meta_class);
/// By names: 0 if `sub_name` is a subclass of `super_name`, 1 if not, -1 on a null or unknown name.
int is_subclass(const Meta_Repository* repository, const char* super_name, const char* sub_name);
/// The class itself, one of its superclasses, or any class of its repository, by name.
const Meta_Class* find_dependent(const Meta_Class* meta_class, const char* name);
/// True if some feature has a bit of `mask`.
bool has_feature(const Meta_Record* record, std::uint32_t mask);

/// Counting of classes and features made at run time; static ones and null are left alone. The last
/// `unref` destroys.
void ref(const Meta_Feature* feature);
void unref(const Meta_Feature* feature);

/// Deep copies with count 1. The class of a reference, and the superclass, are shared and counted;
/// the copy of a class belongs to no repository.
Meta_Class* clone(const Meta_Class* meta_class);
Meta_Feature* clone(const Meta_Feature* feature);
Meta_Qualifier* clone(const Meta_Qualifier* qualifier);
/// Frees a run-time class whatever its count, overwriting it with 0xDD first; a static one stays.
void destroy(Meta_Class* meta_class);

/// A class of count 1. Without `super`: no features, the given flags. With it: a deep copy of
/// `super` that is not abstract, whose features are all inherited; `flags` is not used then.
Meta_Class* create_meta_class(const char* name, const Meta_Class* super, std::uint32_t flags);
/// A readable property of count 1, to be handed to `add_feature`. `offset` follows the layout rule.
Meta_Property* create_property(const char* name, Type type, std::int16_t subscript,
                               std::uint32_t offset, bool key);
/// Appends a local feature to a run-time class, which takes over its reference and grows to hold
/// it.
void add_feature(Meta_Class* meta_class, Meta_Feature* feature);
/// Appends a qualifier to a run-time class or feature, which takes over its reference.
void add_qualifier(Meta_Feature* feature, Meta_Qualifier* qualifier);
/// Removes the named qualifiers (all, for null `names`) from a run-time class and its methods.
void filter_qualifiers(Meta_Class* meta_class, const char* const* names, std::size_t n);

/// MOF-like dump to standard output, for debugging.
void print(const Meta_Class* meta_class, bool print_qualifiers);
/// Deep structural comparison; counts, repositories and addresses do not matter.
bool identical(const Meta_Class* a, const Meta_Class* b);

}  // namespace cimrt
