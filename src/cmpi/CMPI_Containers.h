// The three CMPI objects that hold named values, seen as containers.
#pragma once

#include "cmpi/Container.h"
#include "cmpi/cmpidt.h"

namespace cimrt {

/// What the three have in common: the place of the conversion and the checks of names and types.
class CMPI_Container : public Container {
 protected:
  CMPI_Container(const Meta_Repository* meta_repository, const CMPIBroker* broker,
                 const char* name_space)
      : Container(meta_repository), _broker(broker), _name_space(name_space) {}

  /// False, logged as "bounds error", for an index beyond the list.
  bool in_bounds(std::uint32_t index);
  int to_value(const CMPIData& data, Value& value) const;
  int to_data(const char* name, const Value& value, std::uint32_t flags, CMPIData& data) const;
  /// 0 if `value` has the type asked for, otherwise -1, logged with `name`.
  static int check_type(const char* name, Type type, const Value& value);

  const CMPIBroker* _broker;
  const char* _name_space;
};

/// Properties of a CMPI instance; values are taken as they are.
class CMPIInstance_Container final : public CMPI_Container {
 public:
  CMPIInstance_Container(const Meta_Repository* meta_repository, const CMPIBroker* broker,
                         const char* name_space, const CMPIInstance* instance);
  std::uint32_t get_size() override;
  int get_name(std::uint32_t index, String& name) override;
  int get_value(std::uint32_t index, Type type, Value& value) override;
  int set_value(const char* name, const Value& value, std::uint32_t flags) override;

 private:
  const CMPIInstance* _instance;
};

/// Keys of a CMPI object path; 64-bit integers are narrowed to the width asked for, as servers do
/// not keep the declared one.
class CMPIObjectPath_Container final : public CMPI_Container {
 public:
  /// `path` is changed by `set_value` only.
  CMPIObjectPath_Container(const Meta_Repository* meta_repository, const CMPIBroker* broker,
                           const char* name_space, const CMPIObjectPath* path);
  std::uint32_t get_size() override;
  int get_name(std::uint32_t index, String& name) override;
  int get_value(std::uint32_t index, Type type, Value& value) override;
  int set_value(const char* name, const Value& value, std::uint32_t flags) override;

 private:
  const CMPIObjectPath* _path;
};

/// Arguments of a method call. Texts are cast to the type asked for, as clients may send any value
/// as a text. The record's "return_value" goes to a place of its own instead of an argument.
class CMPIArgs_Container final : public CMPI_Container {
 public:
  /// A null `args` counts as an empty list, to which nothing can be added.
  CMPIArgs_Container(const Meta_Repository* meta_repository, const CMPIBroker* broker,
                     const char* name_space, const CMPIArgs* args);
  std::uint32_t get_size() override;
  int get_name(std::uint32_t index, String& name) override;
  int get_value(std::uint32_t index, Type type, Value& value) override;
  int set_value(const char* name, const Value& value, std::uint32_t flags) override;

  /// What "return_value" was set to; type 0 if it was not.
  const CMPIData& return_value() const { return _return_value; }

 private:
  const CMPIArgs* _args;
  CMPIData _return_value;
};

}  // namespace cimrt
