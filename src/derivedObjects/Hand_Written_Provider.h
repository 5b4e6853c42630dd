// Puts a hand-written provider class in the place of the skeleton.
//
// A hand-written `<Class>_Provider` is a plain class, default constructible, without a base. It
// declares the operations that it does itself, each with its class's typed record; whatever it does
// not declare, the skeleton does. Nothing may be overloaded.
//
//   std::int32_t load();
//   std::int32_t unload();
//   std::int32_t get_instance(const T* model, T*& out);
//   std::int32_t enum_instances(const T* model, const Instance_Handler& handler);
//   std::int32_t create_instance(const T* instance);
//   std::int32_t delete_instance(const T* instance);
//   std::int32_t modify_instance(const T* model, const T* instance);
//   std::int32_t enum_associator_names(const Instance* source, const String& result_class,
//                                      const String& role, const String& result_role,
//                                      const Instance_Handler& handler);
//   std::int32_t enum_references(const Instance* source, const T* model, const String& role,
//                                const Instance_Handler& handler);
//   std::int32_t enum_associators(...)    as enum_associator_names
//
// A method of the class has the method's name and one argument for each field of the call's record,
// the result last. A value is a `Property<X>&`, a reference an `X*&`, an array of references a
// `Property<Array<Instance*>>&`; what is only read may be taken as const or, for a reference, as
// `const X*`. For instance, for uint32 SetGlobalFlag([In] TVXHBA_FCPort REF Target, [In] uint32
// State):
//
//   std::int32_t SetGlobalFlag(const TVXHBA_FCTagService* service, const TVXHBA_FCPort* target,
//                              const Property<std::uint32_t>& state,
//                              Property<std::uint32_t>& return_value);
//
// The instance is the method's object with its keys set; it and the record belong to the caller.
// `return_value` begins as null. Models and instances are of class T or a subclass: a request with
// another class never reaches the provider, except that `enum_instances` and `enum_references` then
// get a null model. References inside them and inside a record may point at instances of any class:
// look them up with the map's `find`, or take them through `typed<X>` before reading their fields.
#pragma once

#include "derivedObjects/Skeleton_Provider.h"
#include "generated/Methods.h"
#include "runtime/Typed_Instance.h"

namespace cimrt {

/// The provider object of a class with a hand-written provider `P` and the record `T`.
template <class P, class T>
class Hand_Written_Provider final : public Skeleton_Provider {
 public:
  using Skeleton_Provider::Skeleton_Provider;

  std::int32_t load() override {
    if constexpr (requires { &P::load; }) return _provider.load();
    return Skeleton_Provider::load();
  }

  std::int32_t unload() override {
    if constexpr (requires { &P::unload; }) return _provider.unload();
    return Skeleton_Provider::unload();
  }

  std::int32_t get_instance(const Instance* model, Instance*& out) override {
    if constexpr (requires { &P::get_instance; }) {
      if (!typed<T>(model)) return GET_INSTANCE_NOT_FOUND;
      T* found = nullptr;
      const std::int32_t status = _provider.get_instance(typed<T>(model), found);
      if (found) out = found;
      return status;
    }
    return Skeleton_Provider::get_instance(model, out);
  }

  std::int32_t enum_instances(const Instance* model, const Instance_Handler& handler) override {
    if constexpr (requires { &P::enum_instances; }) {
      return _provider.enum_instances(typed<T>(model), handler);
    }
    return Skeleton_Provider::enum_instances(model, handler);
  }

  std::int32_t create_instance(const Instance* instance) override {
    if constexpr (requires { &P::create_instance; }) {
      if (!typed<T>(instance)) return CREATE_INSTANCE_INVALID_PARAMETER;
      return _provider.create_instance(typed<T>(instance));
    }
    return Skeleton_Provider::create_instance(instance);
  }

  std::int32_t delete_instance(const Instance* instance) override {
    if constexpr (requires { &P::delete_instance; }) {
      if (!typed<T>(instance)) return DELETE_INSTANCE_NOT_FOUND;
      return _provider.delete_instance(typed<T>(instance));
    }
    return Skeleton_Provider::delete_instance(instance);
  }

  std::int32_t modify_instance(const Instance* model, const Instance* instance) override {
    if constexpr (requires { &P::modify_instance; }) {
      if (!typed<T>(model) || !typed<T>(instance)) return MODIFY_INSTANCE_INVALID_PARAMETER;
      return _provider.modify_instance(typed<T>(model), typed<T>(instance));
    }
    return Skeleton_Provider::modify_instance(model, instance);
  }

  std::int32_t enum_associator_names(const Instance* source, const String& result_class,
                                     const String& role, const String& result_role,
                                     const Instance_Handler& handler) override {
    if constexpr (requires { &P::enum_associator_names; }) {
      return _provider.enum_associator_names(source, result_class, role, result_role, handler);
    }
    return Skeleton_Provider::enum_associator_names(source, result_class, role, result_role,
                                                    handler);
  }

  std::int32_t enum_references(const Instance* source, const Instance* model, const String& role,
                               const Instance_Handler& handler) override {
    if constexpr (requires { &P::enum_references; }) {
      return _provider.enum_references(source, typed<T>(model), role, handler);
    }
    return Skeleton_Provider::enum_references(source, model, role, handler);
  }

  std::int32_t enum_associators(const Instance* source, const String& result_class,
                                const String& role, const String& result_role,
                                const Instance_Handler& handler) override {
    if constexpr (requires { &P::enum_associators; }) {
      return _provider.enum_associators(source, result_class, role, result_role, handler);
    }
    return Skeleton_Provider::enum_associators(source, result_class, role, result_role, handler);
  }

  std::int32_t invoke(const Meta_Method* method, Instance* instance, Instance* record) override {
    // A method of this name in another class may lay out its record differently.
    if (!typed<T>(instance) || record->meta_class != method) return INVOKE_METHOD_UNSUPPORTED;
    return invoke_method(_provider, method->name, typed<T>(instance), record);
  }

 private:
  P _provider;
};

/// `Provider_Entry::create` of a class with a provider of its own.
template <class P, class T>
Skeleton_Provider* create_hand_written(const Provider_Entry& entry) {
  return new Hand_Written_Provider<P, T>(entry);
}

}  // namespace cimrt
