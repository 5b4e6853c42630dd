// Making instances and putting them into the agent's maps: what every map builder uses.
//
// All of it runs on the refresh thread with the agent's map and data locks held. Instances handed
// out stay owned by their map.
#pragma once

#include <initializer_list>
#include <new>
#include <string>
#include <utility>

#include "agent/Format_Text.h"
#include "agent/MapBuild.h"

namespace cimrt {

/// The provider's namespace, as a text that all its instances share.
const String& providerNameSpace();

/// A new instance of T with its defaults, in the provider's namespace. The caller owns it.
template <class T>
Ref<T> makeInstance(const String& nameSpace = providerNameSpace()) {
  Ref<T> instance(T::create());
  instance->__name_space = nameSpace;
  return instance;
}

/// What `make()` makes, or null when memory ran out on the way.
template <class Make>
auto madeOrNull(Make make) -> decltype(make()) {
  try {
    return make();
  } catch (const std::bad_alloc&) {
    return {};
  }
}

/// Moves `instance` into `map`. False when the map holds a key-equal entry: then `failure` is
/// logged at `TVX_CRIT` and the instance is gone.
bool insertInstance(Instance_Map_Base& map, Ref<Instance> instance, const char* failure);

/// Typed form: the entry, or null.
template <class T>
T* insertInto(Instance_Map<T>& map, Ref<T> instance, const char* failure) {
  T* entry = instance.get();
  return insertInstance(map, Ref<Instance>(instance.release()), failure) ? entry : nullptr;
}

/// The same for an instance that is filled in: the map need not look at its keys again.
bool insertFilled(Instance_Map_Base& map, Ref<Instance> instance, const char* failure);
template <class T>
T* insertFilledInto(Instance_Map<T>& map, Ref<T> instance, const char* failure) {
  T* entry = instance.get();
  return insertFilled(map, Ref<Instance>(instance.release()), failure) ? entry : nullptr;
}

/// Puts clones of the ends into the references of `association`, in the order of its class. An end
/// that is null leaves its reference as it was.
void setEnds(Instance* association, std::initializer_list<const Instance*> ends);
inline void setEnds(Instance* association, const Instance* first, const Instance* second) {
  setEnds(association, {first, second});
}

/// A new association between clones of two instances, in the provider's namespace. The caller owns
/// it.
template <class T>
Ref<T> makeAssociation(const Instance* first, const Instance* second) {
  Ref<T> association = makeInstance<T>();
  setEnds(association.get(), first, second);
  return association;
}

/// Makes an association and inserts it. The entry, or null with `failure` logged. With an end
/// missing nothing is made, and that is no failure of the map: the result is null, nothing logged.
template <class T>
T* associate(Instance_Map<T>& map, const Instance* first, const Instance* second,
             const char* failure) {
  if (!first || !second) return nullptr;
  return insertInto(map, makeAssociation<T>(first, second), failure);
}

/// The same for an association of three ends.
template <class T>
T* associate(Instance_Map<T>& map, const Instance* first, const Instance* second,
             const Instance* third, const char* failure) {
  if (!first || !second || !third) return nullptr;
  Ref<T> association = makeInstance<T>();
  setEnds(association.get(), {first, second, third});
  return insertInto(map, std::move(association), failure);
}

/// Puts the ends themselves into the references of `association`, which takes a share in each. For
/// ends that are clones already and that nobody changes any more.
void shareEnds(Instance* association, std::initializer_list<Instance*> ends);

/// Makes an association of such ends, none of them null, and inserts it. The entry, or null with
/// `failure` logged.
template <class T>
T* associateShared(Instance_Map<T>& map, std::initializer_list<Instance*> ends,
                   const char* failure) {
  Ref<T> association = makeInstance<T>();
  shareEnds(association.get(), ends);
  return insertFilledInto(map, std::move(association), failure);
}

/// The first entry of a map whose text property has that value, or null.
template <class T>
T* findByText(Instance_Map<T>& map, Property<String> T::*property, const std::string& text) {
  for (std::size_t i = 0; i < map.size(); i++) {
    const Property<String>& value = map[i]->*property;
    if (!value.is_null() && value.value.equal(text.c_str())) return map[i];
  }
  return nullptr;
}

/// The same, from the end of the map: the youngest entry first.
template <class T>
T* findLastByText(Instance_Map<T>& map, Property<String> T::*property, const std::string& text) {
  for (std::size_t i = map.size(); i-- > 0;) {
    const Property<String>& value = map[i]->*property;
    if (!value.is_null() && value.value.equal(text.c_str())) return map[i];
  }
  return nullptr;
}

}  // namespace cimrt
