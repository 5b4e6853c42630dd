// Hash over the keys of the entries of an instance map. Internal to the runtime.
#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

#include "runtime/Instance.h"

namespace cimrt {

/// Classes of an entry and of everything its keys refer to, in the order of a walk over the key
/// references; null stands for a null reference. Entries of one shape are hashed over the same
/// features, so that one projection of a model on to the shape serves them all.
using Key_Shape = std::vector<const Meta_Record*>;

/// Positions of map entries by key. Does not own the instances; finds candidates only, the map
/// compares them.
class Key_Index {
 public:
  std::size_t size() const { return _entries.size(); }

  /// Files the entry that was appended to the map's list.
  void append(const Instance* instance);
  /// Takes out entry `i`; the entries behind it move up by one.
  void remove(std::size_t i);
  void clear();

  /// Marks entry `i` as one whose keys may have changed since it was filed.
  void suspect(std::size_t i);
  /// Files anew every suspect entry whose keys did change. `instances` is the map's list.
  void settle(const Array<Instance*>& instances);

  /// Calls `accept` with each candidate for `model`; answers the lowest accepted position, or all
  /// ones. Every suspect entry must have been settled.
  template <class Accept>
  std::size_t find_first(const Instance* model, Accept accept) const {
    std::size_t best = static_cast<std::size_t>(-1);
    for (std::size_t s = 0; s < _shapes.size(); ++s) {
      if (_shapes[s].entries == 0) continue;
      std::uint64_t hash = 0;
      if (!project(_shapes[s].shape, model, hash)) continue;
      for (std::size_t slot = home(hash); _slots[slot] != 0; slot = next(slot)) {
        const std::size_t i = _slots[slot] - 1;
        const Entry& entry = _entries[i];
        if (i < best && entry.hash == hash && entry.shape == s && accept(i)) best = i;
      }
    }
    return best;
  }

 private:
  struct Entry {
    std::uint64_t hash;
    std::uint32_t shape;
    bool is_suspect;
  };
  struct Shape {
    Key_Shape shape;
    std::size_t entries;
  };

  static bool project(const Key_Shape& shape, const Instance* model, std::uint64_t& hash);
  Entry describe(const Instance* instance);
  std::uint32_t shape_index(Key_Shape&& shape);
  std::size_t home(std::uint64_t hash) const { return hash & (_slots.size() - 1); }
  std::size_t next(std::size_t slot) const { return (slot + 1) & (_slots.size() - 1); }
  void place(std::size_t i);
  void displace(std::size_t i);
  void grow();

  std::vector<Shape> _shapes;
  std::vector<Entry> _entries;
  std::vector<std::size_t> _slots;  ///< open addressing; 0 is free, else position + 1
  std::vector<std::size_t> _suspects;
};

}  // namespace cimrt
