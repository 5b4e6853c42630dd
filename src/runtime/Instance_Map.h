// List of instances keyed by their key properties, with a hash beside it.
#pragma once

#include <cstddef>
#include <cstdint>

#include "runtime/Provider_Operations.h"

namespace cimrt {

/// Owns its instances and keeps them in insertion order. `find` answers the first entry that is
/// key-equal, and `insert` refuses a key-equal instance, both in constant time; removing is linear.
///
/// Entries may be changed in place, keys too. An entry that was inserted, looked up or fetched
/// through a non-constant map is checked again at the next look-up, so whoever fetches, changes and
/// lets go need do nothing. Only a pointer that was kept across a look-up and is then used to
/// change a key needs `key_changed`; forgetting it can make `find` miss the changed entry, never
/// answer a wrong one.
///
/// Not locked, and the constant operations check entries too: callers hold the agent's locks for
/// all of them.
class Instance_Map_Base {
 public:
  static constexpr std::size_t npos = static_cast<std::size_t>(-1);

  explicit Instance_Map_Base(const Meta_Class* meta_class);
  ~Instance_Map_Base();
  Instance_Map_Base(const Instance_Map_Base&) = delete;
  Instance_Map_Base& operator=(const Instance_Map_Base&) = delete;

  const Meta_Class* meta_class() const { return _meta_class; }
  std::size_t size() const { return _instances.size(); }
  /// The entry, for change in place too: its keys are checked again at the next look-up.
  Instance* at(std::size_t i);
  const Instance* at(std::size_t i) const { return _instances[i]; }

  /// Index of the first entry for which `key_eq(entry, model)` holds, or `npos`.
  std::size_t find(const Instance* model) const;
  /// The found entry itself, or null.
  Instance* lookup(const Instance* model);
  /// A clone of the found entry into `out`: 0, or 60 when not found (`out` untouched).
  std::int32_t get_instance(const Instance* model, Instance*& out) const;
  /// A clone of each entry to the handler with status 0, until it answers false. Answers 0.
  std::int32_t enum_instances(const Instance_Handler& handler) const;
  /// The same, but each entry is destroyed as soon as its clone is made, and in the end all are.
  /// Memory that was just read is written to again, so a large map costs no more an entry than a
  /// small one.
  void drain(const Instance_Handler& handler);
  /// Takes ownership and answers the index when the key is new; `npos`, with the instance left to
  /// the caller, when a key-equal entry exists.
  std::size_t insert(Instance* instance);
  /// The same for an instance that is filled in: its keys stay as they are until the entry is
  /// fetched. Empties `instance` when it takes it.
  std::size_t take(Ref<Instance>& instance);
  /// Makes room for `n` entries in all.
  void reserve(std::size_t n);
  std::int32_t create_instance(const Instance* instance);  ///< inserts a clone: 0 or 80
  std::int32_t modify_instance(const Instance* model, const Instance* instance);  ///< 0 or 100
  std::int32_t delete_instance(const Instance* model);                            ///< 0 or 90
  /// Destroys the entries from `n` on, whatever their counts.
  void shorten(std::size_t n);
  /// Destroys every entry, whatever its count.
  void clear();

  /// Tells that a key of entry `i` was changed through a pointer kept across a look-up.
  void key_changed(std::size_t i);

 private:
  struct Index;
  std::size_t append(Instance* instance);
  const Meta_Class* _meta_class;
  Array<Instance*> _instances;
  Index* _index;
};

/// Typed shell.
template <class T>
class Instance_Map : public Instance_Map_Base {
 public:
  Instance_Map() : Instance_Map_Base(&T::static_meta_class) {}
  T* operator[](std::size_t i) { return static_cast<T*>(at(i)); }
  const T* operator[](std::size_t i) const { return static_cast<const T*>(at(i)); }
};

}  // namespace cimrt
