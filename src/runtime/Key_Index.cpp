#include "runtime/Key_Index.h"

#include <algorithm>
#include <bit>
#include <cstring>
#include <limits>
#include <stdexcept>
#include <utility>

#include "runtime/Key_Features.h"

namespace cimrt {
namespace {

constexpr std::size_t FIRST_SLOTS = 16;
/// Enough for an association and its ends, and for most maps.
constexpr std::size_t USUAL_NODES = 8;
constexpr std::size_t USUAL_SHAPES = 4;

/// Running hash; equal sequences of words give equal results.
class Hash {
 public:
  void add(std::uint64_t word) {
    const auto product = static_cast<Wide>(_state ^ word) * 0x9E3779B97F4A7C15u;
    _state = static_cast<std::uint64_t>(product) ^ static_cast<std::uint64_t>(product >> 64);
    _state += 0xD1B54A32D192ED03u;
  }

  void add_bytes(const void* data, std::size_t n) {
    const auto* p = static_cast<const char*>(data);
    add(n);
    for (; n >= sizeof(std::uint64_t); n -= sizeof(std::uint64_t), p += sizeof(std::uint64_t))
      add(word(p, sizeof(std::uint64_t)));
    if (n != 0) add(word(p, n));
  }

  /// The result, with the low bits depending on all others.
  std::uint64_t result() const { return _state ^ (_state >> 32); }

 private:
  __extension__ using Wide = unsigned __int128;

  static std::uint64_t word(const char* p, std::size_t n) {
    std::uint64_t value = 0;
    std::memcpy(&value, p, n);
    return value;
  }

  std::uint64_t _state = 0x2545F4914F6CDD1Du;
};

template <class T>
const T& at(const void* p) {
  return *static_cast<const T*>(p);
}

/// Both zeros compare equal, so they hash alike.
void add_real(Hash& hash, double value) {
  const double normal = value == 0.0 ? 0.0 : value;
  hash.add_bytes(&normal, sizeof normal);
}

void add_scalar(Hash& hash, const void* p, std::uint16_t type) {
  switch (type) {
    case REAL32:
      return add_real(hash, static_cast<double>(at<float>(p)));
    case REAL64:
      return add_real(hash, at<double>(p));
    case STRING:
      return hash.add_bytes(at<String>(p).c_str(), at<String>(p).size());
    case DATETIME:
      hash.add(at<Datetime>(p).usec());
      hash.add(static_cast<std::uint64_t>(at<Datetime>(p).utc()));
      return hash.add(at<Datetime>(p).is_timestamp() ? 1 : 0);
    default:
      return hash.add_bytes(p, type_size_table[type]);
  }
}

void add_property(Hash& hash, const Instance* instance, const Meta_Property* mp) {
  hash.add(*null_flag(instance, mp) != 0 ? 1 : 0);
  const void* p = storage(instance, mp);
  if (mp->subscript == 0) {
    add_scalar(hash, p, mp->type);
    return;
  }
  const auto& array = at<Array_Base>(p);
  hash.add(array.size());
  for (std::size_t i = 0; i < array.size(); ++i) add_scalar(hash, array.element(i), mp->type);
}

/// Only the outline of an array of references: what its elements refer to is left to comparison.
void add_reference_array(Hash& hash, const Instance* instance, const Meta_Feature* f) {
  hash.add(*null_flag(instance, f) != 0 ? 1 : 0);
  hash.add(targets_of(instance, f).size());
}

/// Whose keys a walk along a shape takes.
enum class Fit {
  EXACT,  ///< only an instance that has the shape itself
  KEYS    ///< any that has the same keys
};

/// Hashes the keys of `instance` that entries of a shape have. `next` walks along the shape.
/// False if the instance does not fit: no entry of that shape can be key-equal to it, or, with
/// `EXACT`, it has another shape.
bool add_keys(Hash& hash, const Instance* instance, const Key_Node*& next, Fit fit) {
  const Key_Node& node = *next++;
  const bool same_class = instance->meta_class == node.record;
  if (fit == Fit::EXACT && !same_class) return false;
  for (const Meta_Feature* key : node.keys) {
    const Meta_Feature* f = same_class ? key : matching_key(key, instance->meta_class);
    if (!f) return false;
    if (is_property(f)) {
      add_property(hash, instance, as_property(f));
    } else if (!is_scalar_reference(f)) {
      add_reference_array(hash, instance, f);
    } else {
      const Instance* target = target_of(instance, f);
      if ((target == nullptr) != (next->record == nullptr)) return false;
      if (!target) {
        ++next;
      } else if (!add_keys(hash, target, next, fit)) {
        return false;
      }
    }
  }
  return true;
}

/// The keys of a class, in the order of its features.
std::vector<const Meta_Feature*> keys_of(const Meta_Record* record) {
  std::vector<const Meta_Feature*> keys;
  for (std::uint64_t i = 0; i < record->num_meta_features; ++i) {
    const Meta_Feature* f = record->meta_features[i];
    if (is_key(f) && !is_method(f)) keys.push_back(f);
  }
  return keys;
}

void add_shape(Key_Shape& shape, const Instance* instance) {
  if (!instance) {
    shape.push_back({nullptr, {}});
    return;
  }
  const std::vector<const Meta_Feature*> keys = keys_of(instance->meta_class);
  shape.push_back({instance->meta_class, keys});
  for (const Meta_Feature* key : keys)
    if (is_scalar_reference(key)) add_shape(shape, target_of(instance, key));
}

bool hash_keys(const Key_Shape& shape, const Instance* instance, Fit fit, std::uint64_t& out) {
  Hash hash;
  const Key_Node* next = shape.data();
  if (!add_keys(hash, instance, next, fit)) return false;
  out = hash.result();
  return true;
}

}  // namespace

bool Key_Index::project(const Key_Shape& shape, const Instance* model, std::uint64_t& out) {
  return hash_keys(shape, model, Fit::KEYS, out);
}

Key_Index::Entry Key_Index::describe(const Instance* instance) {
  std::uint64_t hash = 0;
  std::size_t s = 0;
  while (s < _shapes.size() && !hash_keys(_shapes[s].shape, instance, Fit::EXACT, hash)) ++s;
  if (s == _shapes.size()) {
    Key_Shape shape;
    shape.reserve(USUAL_NODES);
    if (_shapes.empty()) _shapes.reserve(USUAL_SHAPES);
    add_shape(shape, instance);
    hash_keys(shape, instance, Fit::EXACT, hash);
    _shapes.push_back({std::move(shape), 0});
  }
  return {hash, static_cast<std::uint32_t>(s), false};
}

void Key_Index::place(std::size_t i) {
  std::size_t slot = home(_entries[i].hash);
  while (_slots[slot].place != 0) slot = next(slot);
  _slots[slot] = {static_cast<std::uint32_t>(i + 1), tag_of(_entries[i].hash)};
  ++_shapes[_entries[i].shape].entries;
}

/// Empties the slot of entry `i` and moves the slots behind it back towards their homes.
void Key_Index::displace(std::size_t i) {
  --_shapes[_entries[i].shape].entries;
  std::size_t hole = home(_entries[i].hash);
  while (_slots[hole].place != i + 1) hole = next(hole);
  const std::size_t mask = _slots.size() - 1;
  for (std::size_t slot = next(hole); _slots[slot].place != 0; slot = next(slot)) {
    const std::size_t wanted = home(_entries[_slots[slot].place - 1].hash);
    if (((slot - wanted) & mask) < ((slot - hole) & mask)) continue;
    _slots[hole] = _slots[slot];
    hole = slot;
  }
  _slots[hole] = {};
}

/// `n` is a power of two. A position has to fit in a slot.
void Key_Index::set_slots(std::size_t n) {
  if (n > std::numeric_limits<std::uint32_t>::max()) throw std::length_error("too many instances");
  _slots.assign(n, {});
  for (Shape& shape : _shapes) shape.entries = 0;
  for (std::size_t i = 0; i < _entries.size(); ++i) place(i);
  _is_stale = false;
}

void Key_Index::reserve(std::size_t n) {
  _entries.reserve(n);
  if (n * 2 > _slots.size()) set_slots(std::bit_ceil(std::max(n * 2, FIRST_SLOTS)));
}

void Key_Index::append(const Entry& entry) {
  // What needs memory comes before what is seen from outside.
  if ((_entries.size() + 1) * 2 > _slots.size())
    set_slots(_slots.empty() ? FIRST_SLOTS : _slots.size() * 2);
  if (_suspects.size() == _suspects.capacity()) _suspects.reserve(2 * _suspects.size() + 1);
  _entries.push_back(entry);
  place(_entries.size() - 1);
}

void Key_Index::remove(std::size_t i) {
  displace(i);
  _entries.erase(_entries.begin() + static_cast<std::ptrdiff_t>(i));
  std::erase(_suspects, i);
  for (std::size_t& s : _suspects)
    if (s > i) --s;
  if (i == _entries.size()) return;
  for (Slot& slot : _slots)
    if (slot.place > i + 1) --slot.place;
}

void Key_Index::shorten(std::size_t n) {
  _entries.resize(n);
  std::erase_if(_suspects, [n](std::size_t i) { return i >= n; });
  _is_stale = true;
}

void Key_Index::clear() {
  _is_stale = false;
  _shapes.clear();
  _entries.clear();
  // As many entries are likely to come again: the room stays.
  std::fill(_slots.begin(), _slots.end(), Slot{});
  _suspects.clear();
}

void Key_Index::suspect(std::size_t i) {
  if (_entries[i].is_suspect) return;
  _suspects.push_back(i);
  _entries[i].is_suspect = true;
}

void Key_Index::settle(const Array<Instance*>& instances) {
  if (_is_stale) set_slots(_slots.size());
  for (const std::size_t i : _suspects) {
    const Entry now = describe(instances[i]);
    Entry& filed = _entries[i];
    if (filed.hash != now.hash || filed.shape != now.shape) {
      displace(i);
      filed = now;
      place(i);
    }
    filed.is_suspect = false;
  }
  _suspects.clear();
}

}  // namespace cimrt
