#include "runtime/Instance_Map.h"

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

std::size_t Instance_Map_Base::insert(Instance* instance) {
  if (find(instance) != npos) return npos;
  const std::size_t i = _instances.size();
  _instances.append(instance);
  try {
    _index->append(instance);
  } catch (...) {
    _instances.remove(i, 1);  // the caller keeps it
    throw;
  }
  // Who inserts an instance still holds it and may go on filling it in.
  _index->suspect(i);
  return i;
}

std::int32_t Instance_Map_Base::create_instance(const Instance* instance) {
  if (find(instance) != npos) return CREATE_INSTANCE_DUPLICATE;
  Ref<Instance> copy(clone(instance));
  insert(copy.get());
  copy.release();
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

void Instance_Map_Base::clear() {
  for (Instance* instance : _instances) destroy(instance);
  _instances.clear();
  _index->clear();
}

void Instance_Map_Base::key_changed(std::size_t i) {
  _index->suspect(i);
}

}  // namespace cimrt
