#include "runtime/Key_Index.h"

#include <algorithm>
#include <cstring>
#include <utility>

#include "runtime/Key_Features.h"

namespace cimrt {
namespace {

constexpr std::size_t FIRST_SLOTS = 16;

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

/// Hashes the keys of `instance` that entries of a shape have. `next` walks along the shape.
/// False if no entry of that shape can be key-equal to the instance.
bool add_keys(Hash& hash, const Instance* instance, const Meta_Record* const*& next) {
  const Meta_Record* record = *next++;
  const bool same_class = instance->meta_class == record;
  for (std::uint64_t i = 0; i < record->num_meta_features; ++i) {
    const Meta_Feature* key = record->meta_features[i];
    if (!is_key(key) || is_method(key)) continue;
    const Meta_Feature* f = same_class ? key : matching_key(key, instance->meta_class);
    if (!f) return false;
    if (is_property(f)) {
      add_property(hash, instance, as_property(f));
    } else if (!is_scalar_reference(f)) {
      add_reference_array(hash, instance, f);
    } else {
      const Instance* target = target_of(instance, f);
      if ((target == nullptr) != (*next == nullptr)) return false;
      if (!target) {
        ++next;
      } else if (!add_keys(hash, target, next)) {
        return false;
      }
    }
  }
  return true;
}

void add_shape(Key_Shape& shape, const Instance* instance) {
  shape.push_back(instance ? instance->meta_class : nullptr);
  if (!instance) return;
  const Meta_Record* record = instance->meta_class;
  for (std::uint64_t i = 0; i < record->num_meta_features; ++i) {
    const Meta_Feature* key = record->meta_features[i];
    if (is_key(key) && is_scalar_reference(key)) add_shape(shape, target_of(instance, key));
  }
}

}  // namespace

bool Key_Index::project(const Key_Shape& shape, const Instance* model, std::uint64_t& out) {
  Hash hash;
  const Meta_Record* const* next = shape.data();
  if (!add_keys(hash, model, next)) return false;
  out = hash.result();
  return true;
}

std::uint32_t Key_Index::shape_index(Key_Shape&& shape) {
  std::size_t i = 0;
  while (i < _shapes.size() && _shapes[i].shape != shape) ++i;
  if (i == _shapes.size()) _shapes.push_back({std::move(shape), 0});
  return static_cast<std::uint32_t>(i);
}

Key_Index::Entry Key_Index::describe(const Instance* instance) {
  Key_Shape shape;
  add_shape(shape, instance);
  std::uint64_t hash = 0;
  project(shape, instance, hash);
  return {hash, shape_index(std::move(shape)), false};
}

void Key_Index::place(std::size_t i) {
  std::size_t slot = home(_entries[i].hash);
  while (_slots[slot] != 0) slot = next(slot);
  _slots[slot] = i + 1;
  ++_shapes[_entries[i].shape].entries;
}

/// Empties the slot of entry `i` and moves the slots behind it back towards their homes.
void Key_Index::displace(std::size_t i) {
  --_shapes[_entries[i].shape].entries;
  std::size_t hole = home(_entries[i].hash);
  while (_slots[hole] != i + 1) hole = next(hole);
  const std::size_t mask = _slots.size() - 1;
  for (std::size_t slot = next(hole); _slots[slot] != 0; slot = next(slot)) {
    const std::size_t wanted = home(_entries[_slots[slot] - 1].hash);
    if (((slot - wanted) & mask) < ((slot - hole) & mask)) continue;
    _slots[hole] = _slots[slot];
    hole = slot;
  }
  _slots[hole] = 0;
}

void Key_Index::grow() {
  const std::size_t n = _slots.empty() ? FIRST_SLOTS : _slots.size() * 2;
  _slots.assign(n, 0);
  for (Shape& shape : _shapes) shape.entries = 0;
  for (std::size_t i = 0; i < _entries.size(); ++i) place(i);
}

void Key_Index::append(const Instance* instance) {
  // What needs memory comes before what is seen from outside.
  if ((_entries.size() + 1) * 2 > _slots.size()) grow();
  if (_suspects.size() == _suspects.capacity()) _suspects.reserve(2 * _suspects.size() + 1);
  _entries.push_back(describe(instance));
  place(_entries.size() - 1);
}

void Key_Index::remove(std::size_t i) {
  displace(i);
  _entries.erase(_entries.begin() + static_cast<std::ptrdiff_t>(i));
  std::erase(_suspects, i);
  for (std::size_t& s : _suspects)
    if (s > i) --s;
  if (i == _entries.size()) return;
  for (std::size_t& slot : _slots)
    if (slot > i + 1) --slot;
}

void Key_Index::clear() {
  _shapes.clear();
  _entries.clear();
  _slots.clear();
  _suspects.clear();
}

void Key_Index::suspect(std::size_t i) {
  if (_entries[i].is_suspect) return;
  _suspects.push_back(i);
  _entries[i].is_suspect = true;
}

void Key_Index::settle(const Array<Instance*>& instances) {
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
