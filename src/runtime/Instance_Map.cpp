#include "runtime/Instance_Map.h"

#include <utility>

#include "runtime/Key_Index.h"

namespace cimrt {

struct Instance_Map_Base::Index : Key_Index {};

Instance_Map_Base::Instance_Map_Base(const Meta_Class* meta_class)
    : _meta_class(meta_class), _index(new Index) {}

Instance_Map_Base::~Instance_Map_Base() {
  clear();
  delete _index;
}

Instance* Instance_Map_Base::at(std::size_t i) {
  _index->suspect(i);
  return _instances[i];
}

std::size_t Instance_Map_Base::find(const Instance* model) const {
  if (!model) return npos;
  _index->settle(_instances);
  return _index->find_first(model, [&](std::size_t i) { return key_eq(_instances[i], model); });
}

Instance* Instance_Map_Base::lookup(const Instance* model) {
  const std::size_t i = find(model);
  return i == npos ? nullptr : at(i);
}

std::int32_t Instance_Map_Base::get_instance(const Instance* model, Instance*& out) const {
  const std::size_t i = find(model);
  if (i == npos) return GET_INSTANCE_NOT_FOUND;
  out = clone(_instances[i]);
  return GET_INSTANCE_OK;
}

std::int32_t Instance_Map_Base::enum_instances(const Instance_Handler& handler) const {
  for (const Instance* instance : _instances)
    if (!handler.handle(clone(instance), ENUM_INSTANCES_OK)) break;
  return ENUM_INSTANCES_OK;
}

void Instance_Map_Base::drain(const Instance_Handler& handler) {
  // Null entries must not be seen, whatever the handler throws.
  struct Rest {
    Instance_Map_Base& map;
    ~Rest() { map.clear(); }
  } const rest{*this};
  for (Instance*& entry : _instances) {
    Instance* const copy = clone(entry);
    destroy(std::exchange(entry, nullptr));
    if (!handler.handle(copy, ENUM_INSTANCES_OK)) break;
  }
}

/// `npos` for a key-equal instance. If it throws, the caller keeps the instance.
std::size_t Instance_Map_Base::append(Instance* instance) {
  _index->settle(_instances);
  const Key_Index::Entry entry = _index->describe(instance);
  const std::size_t same = _index->find_first(
      instance, [&](std::size_t i) { return key_eq(_instances[i], instance); }, &entry);
  if (same != npos) return npos;
  // The list's own growth is by one: it would be moved at each step.
  const std::size_t i = _instances.size();
  if (i == _instances.capacity()) _instances.reserve(2 * i);
  _index->append(entry);
  _instances.append(instance);
  return i;
}

std::size_t Instance_Map_Base::insert(Instance* instance) {
  const std::size_t i = append(instance);
  // Who inserts an instance still holds it and may go on filling it in.
  if (i != npos) _index->suspect(i);
  return i;
}

std::size_t Instance_Map_Base::take(Ref<Instance>& instance) {
  const std::size_t i = append(instance.get());
  if (i != npos) instance.release();
  return i;
}

void Instance_Map_Base::reserve(std::size_t n) {
  _instances.reserve(n);
  _index->reserve(n);
}

std::int32_t Instance_Map_Base::create_instance(const Instance* instance) {
  if (find(instance) != npos) return CREATE_INSTANCE_DUPLICATE;
  Ref<Instance> copy(clone(instance));
  take(copy);
  return CREATE_INSTANCE_OK;
}

std::int32_t Instance_Map_Base::modify_instance(const Instance* model, const Instance* instance) {
  const std::size_t i = find(model);
  if (i == npos) return MODIFY_INSTANCE_NOT_FOUND;
  copy(at(i), instance, model);
  return MODIFY_INSTANCE_OK;
}

std::int32_t Instance_Map_Base::delete_instance(const Instance* model) {
  const std::size_t i = find(model);
  if (i == npos) return DELETE_INSTANCE_NOT_FOUND;
  destroy(_instances[i]);
  _instances.remove(i, 1);
  _index->remove(i);
  return DELETE_INSTANCE_OK;
}

void Instance_Map_Base::shorten(std::size_t n) {
  if (n >= _instances.size()) return;
  for (std::size_t i = n; i < _instances.size(); ++i) destroy(_instances[i]);
  _instances.remove(n, _instances.size() - n);
  _index->shorten(n);
}

void Instance_Map_Base::clear() {
  for (Instance* instance : _instances) destroy(instance);
  _instances.clear();
  _index->clear();
}

void Instance_Map_Base::key_changed(std::size_t i) {
  _index->suspect(i);
}

}  // namespace cimrt
