// Hash over the keys of the entries of an instance map. Internal to the runtime.
#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

#include "runtime/Instance.h"

namespace cimrt {

/// A class whose keys are hashed, and those keys. No class, and no keys: a null reference.
struct Key_Node {
  const Meta_Record* record;
  std::vector<const Meta_Feature*> keys;
};

/// Classes of an entry and of everything its keys refer to, in the order of a walk over the key
/// references. Entries of one shape are hashed over the same features, so that one projection of a
/// model on to the shape serves them all.
using Key_Shape = std::vector<Key_Node>;

/// Positions of map entries by key. Does not own the instances; finds candidates only, the map
/// compares them.
class Key_Index {
 public:
  /// What is filed of an instance.
  struct Entry {
    std::uint64_t hash;
    std::uint32_t shape;
    bool is_suspect;
  };

  std::size_t size() const { return _entries.size(); }

  /// Makes room for `n` entries in all.
  void reserve(std::size_t n);
  /// Hashes the keys of an instance, which need not be in the map.
  Entry describe(const Instance* instance);
  /// Files the entry that was appended to the map's list.
  void append(const Entry& entry);
  /// Takes out entry `i`; the entries behind it move up by one.
  void remove(std::size_t i);
  /// Takes out the entries from `n` on. The others are filed anew by the next `settle`.
  void shorten(std::size_t n);
  void clear();

  /// Marks entry `i` as one whose keys may have changed since it was filed.
  void suspect(std::size_t i);
  /// Files anew every suspect entry whose keys did change. `instances` is the map's list.
  void settle(const Array<Instance*>& instances);

  /// Calls `accept` with each candidate for `model`; answers the lowest accepted position, or all
  /// ones. Every suspect entry must have been settled. `described`, if given, is what `describe`
  /// tells of the model.
  template <class Accept>
  std::size_t find_first(const Instance* model, Accept accept,
                         const Entry* described = nullptr) const {
    std::size_t best = static_cast<std::size_t>(-1);
    for (std::size_t s = 0; s < _shapes.size(); ++s) {
      if (_shapes[s].entries == 0) continue;
      std::uint64_t hash = 0;
      if (described && described->shape == s) {
        hash = described->hash;
      } else if (!project(_shapes[s].shape, model, hash)) {
        continue;
      }
      for (std::size_t slot = home(hash); _slots[slot].place != 0; slot = next(slot)) {
        if (_slots[slot].tag != tag_of(hash)) continue;
        const std::size_t i = _slots[slot].place - 1;
        const Entry& entry = _entries[i];
        if (i < best && entry.hash == hash && entry.shape == s && accept(i)) best = i;
      }
    }
    return best;
  }

 private:
  struct Shape {
    Key_Shape shape;
    std::size_t entries;
  };

  /// The tag spares the look at an entry that is in the way of another.
  struct Slot {
    std::uint32_t place = 0;  ///< position of the entry + 1; 0: free
    std::uint32_t tag = 0;
  };

  static std::uint32_t tag_of(std::uint64_t hash) { return static_cast<std::uint32_t>(hash >> 32); }
  static bool project(const Key_Shape& shape, const Instance* model, std::uint64_t& hash);
  std::size_t home(std::uint64_t hash) const { return hash & (_slots.size() - 1); }
  std::size_t next(std::size_t slot) const { return (slot + 1) & (_slots.size() - 1); }
  void place(std::size_t i);
  void displace(std::size_t i);
  void set_slots(std::size_t n);

  std::vector<Shape> _shapes;
  std::vector<Entry> _entries;
  std::vector<Slot> _slots;  ///< open addressing; at most half of them are taken
  std::vector<std::size_t> _suspects;
  bool _is_stale = false;  ///< the slots tell of entries that are gone
};

}  // namespace cimrt
