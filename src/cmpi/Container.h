// An indexed list of named values, and the conversion between such a list and an instance.
#pragma once

#include <cstdint>

#include "runtime/Instance.h"
#include "runtime/Value.h"

namespace cimrt {

/// What a CMPI instance, object path and argument list have in common. A local object of one
/// request; owns nothing that it wraps. All answers are 0, or non-zero on failure.
class Container {
 public:
  /// `meta_repository` resolves the classes of embedded instances and references.
  explicit Container(const Meta_Repository* meta_repository) : _meta_repository(meta_repository) {}
  virtual ~Container() = default;
  Container(const Container&) = delete;
  Container& operator=(const Container&) = delete;

  virtual std::uint32_t get_size() = 0;
  virtual int get_name(std::uint32_t index, String& name) = 0;
  /// The value at `index`, as a value of `type`.
  virtual int get_value(std::uint32_t index, Type type, Value& value) = 0;
  /// `flags` are those of the feature that the value comes from.
  virtual int set_value(const char* name, const Value& value, std::uint32_t flags) = 0;

  /// From the list into an instance. If `instance` is null a new one of `meta_class` (a class or a
  /// method) is made, otherwise its properties are made null first. Only features that share a bit
  /// with `flags` are taken, or all with 0. Single values that fail are logged and stay null.
  int convert(const Meta_Record* meta_class, std::uint32_t flags, Instance*& instance);

  /// From an instance into the list. Null features are left out, as are those that do not pass
  /// `flags`. Single values that fail are logged.
  int convert(const Instance* instance, std::uint32_t flags);

 protected:
  const Meta_Repository* meta_repository() const { return _meta_repository; }

 private:
  void take(std::uint32_t index, const Meta_Record* meta_class, std::uint32_t flags,
            Instance* instance);
  void give(const Instance* instance, const Meta_Feature* feature);

  const Meta_Repository* _meta_repository;
};

/// True for a null property, a null array of references and an empty scalar reference.
bool is_null(const Instance* instance, const Meta_Feature* feature);

}  // namespace cimrt
