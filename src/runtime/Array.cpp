#include "runtime/Array.h"

#include <cstdlib>
#include <cstring>
#include <new>
#include <vector>

#include "runtime/Datetime.h"
#include "runtime/String.h"

namespace cimrt {
namespace {

constexpr std::size_t FIRST_CAPACITY = 8;
constexpr std::size_t SPARE_BYTES = 8;
constexpr std::size_t NOT_FOUND = static_cast<std::size_t>(-1);

template <class T>
void construct_from(void* to, const void* from) {
  ::new (to) T(*static_cast<const T*>(from));
}

template <class T>
void destroy_one(void* element) {
  static_cast<T*>(element)->~T();
}

template <class T>
bool equal_values(const void* a, const void* b) {
  return *static_cast<const T*>(a) == *static_cast<const T*>(b);
}

/// Has no elements and is never written to. The spare bytes stand behind it as behind any rep.
struct No_Room {
  ArrayRep rep;
  char spare[SPARE_BYTES];
};

using Construct = decltype(Array_Traits::construct);
using Destroy = decltype(Array_Traits::destroy);
using Equal = decltype(Array_Traits::equal);

/// An element type of that size and those operations.
template <std::size_t SIZE, Construct CONSTRUCT, Destroy DESTROY, Equal EQUAL>
struct Element {
  static No_Room no_room;
  static constexpr Array_Traits traits = {SIZE, CONSTRUCT, DESTROY, EQUAL, &no_room.rep};
};

template <std::size_t SIZE, Construct CONSTRUCT, Destroy DESTROY, Equal EQUAL>
constinit No_Room Element<SIZE, CONSTRUCT, DESTROY, EQUAL>::no_room = {{&traits, 0, 0, 0}, {}};

template <class T>
using Plain = Element<sizeof(T), nullptr, nullptr, nullptr>;
template <class T>
using Real = Element<sizeof(T), nullptr, nullptr, equal_values<T>>;
template <class T>
using Object = Element<sizeof(T), construct_from<T>, destroy_one<T>, equal_values<T>>;

std::size_t block_size(const Array_Traits* traits, std::size_t capacity) {
  std::size_t bytes = 0;
  if (__builtin_mul_overflow(capacity, traits->size, &bytes) ||
      __builtin_add_overflow(bytes, sizeof(ArrayRep) + SPARE_BYTES, &bytes))
    throw std::bad_alloc();
  return bytes;
}

ArrayRep* allocate(const Array_Traits* traits, std::size_t capacity) {
  auto* rep = static_cast<ArrayRep*>(std::malloc(block_size(traits, capacity)));
  if (!rep) throw std::bad_alloc();
  rep->traits = traits;
  rep->size = 0;
  rep->capacity = capacity;
  rep->reserved = 0;
  return rep;
}

/// Copies `n` elements into raw storage.
void copy_in(const Array_Traits* traits, void* to, const void* from, std::size_t n) {
  if (n == 0) return;
  if (!traits->construct) {
    std::memcpy(to, from, n * traits->size);
    return;
  }
  for (std::size_t i = 0; i < n; ++i)
    traits->construct(static_cast<char*>(to) + i * traits->size,
                      static_cast<const char*>(from) + i * traits->size);
}

void destroy_range(ArrayRep* rep, std::size_t pos, std::size_t n) {
  if (!rep->traits->destroy) return;
  for (std::size_t i = pos; i < pos + n; ++i) rep->traits->destroy(rep->element(i));
}

ArrayRep* make(const Array_Traits* traits, const void* data, std::size_t n) {
  if (n == 0 && traits->no_room) return traits->no_room;
  ArrayRep* rep = allocate(traits, n);
  copy_in(traits, rep->element(0), data, n);
  rep->size = n;
  return rep;
}

void release(ArrayRep* rep) {
  if (rep == rep->traits->no_room) return;
  destroy_range(rep, 0, rep->size);
  std::free(rep);
}

bool lies_in(const ArrayRep* rep, const void* data) {
  const auto* p = static_cast<const char*>(data);
  const auto* first = static_cast<const char*>(rep->element(0));
  return p >= first && p < static_cast<const char*>(rep->element(rep->size));
}

}  // namespace

constinit const Array_Traits* const array_traits[NUM_TYPES] = {
    &Plain<bool>::traits,          &Plain<std::uint8_t>::traits,  &Plain<std::int8_t>::traits,
    &Plain<std::uint16_t>::traits, &Plain<std::int16_t>::traits,  &Plain<std::uint32_t>::traits,
    &Plain<std::int32_t>::traits,  &Plain<std::uint64_t>::traits, &Plain<std::int64_t>::traits,
    &Real<float>::traits,          &Real<double>::traits,         &Plain<char16_t>::traits,
    &Object<String>::traits,       &Object<Datetime>::traits,
};

namespace {

constinit No_Room no_instances = {{&instance_array_traits, 0, 0, 0}, {}};

}  // namespace

// NOLINTNEXTLINE(bugprone-sizeof-expression): the elements are the bare pointers
constinit const Array_Traits instance_array_traits = {sizeof(Instance*), nullptr, nullptr, nullptr,
                                                      &no_instances.rep};

Array_Base::Array_Base(const Array_Traits* traits) : _rep(allocate(traits, FIRST_CAPACITY)) {}

Array_Base::Array_Base(const Array_Traits* traits, const void* data, std::size_t n)
    : _rep(make(traits, data, n)) {}

Array_Base::Array_Base(const Array_Base& other)
    : _rep(make(other.traits(), other.element(0), other.size())) {}

Array_Base::~Array_Base() {
  release(_rep);
}

Array_Base& Array_Base::operator=(const Array_Base& other) {
  if (this == &other) return *this;
  ArrayRep* old = _rep;
  _rep = make(other.traits(), other.element(0), other.size());
  release(old);
  return *this;
}

void Array_Base::assign(const void* data, std::size_t n) {
  ArrayRep* old = _rep;
  _rep = make(old->traits, data, n);
  release(old);
}

void Array_Base::reserve(std::size_t n) {
  if (n <= _rep->capacity) return;
  if (_rep == _rep->traits->no_room) {
    _rep = allocate(_rep->traits, n);
    return;
  }
  auto* rep = static_cast<ArrayRep*>(std::realloc(_rep, block_size(_rep->traits, n)));
  if (!rep) throw std::bad_alloc();
  _rep = rep;
  _rep->capacity = n;
}

void Array_Base::resize(std::size_t n, const void* fill) {
  const std::size_t old_size = _rep->size;
  if (n <= old_size) {
    remove(n, old_size - n);
    return;
  }
  if (_rep->traits->construct && lies_in(_rep, fill)) {
    const Array_Base own(_rep->traits, fill, 1);
    resize(n, own.element(0));
    return;
  }
  reserve(n);
  if (!_rep->traits->construct) {
    std::memset(_rep->element(old_size), 0, (n - old_size) * _rep->traits->size);
  } else {
    for (std::size_t i = old_size; i < n; ++i) _rep->traits->construct(_rep->element(i), fill);
  }
  _rep->size = n;
}

void Array_Base::insert(std::size_t pos, const void* data, std::size_t n) {
  if (n == 0) return;
  if (lies_in(_rep, data)) {
    const Array_Base own(_rep->traits, data, n);
    insert(pos, own.element(0), n);
    return;
  }
  const std::size_t old_size = _rep->size;
  if (pos > old_size) pos = old_size;
  reserve(old_size + n);
  std::memmove(_rep->element(pos + n), _rep->element(pos), (old_size - pos) * _rep->traits->size);
  copy_in(_rep->traits, _rep->element(pos), data, n);
  _rep->size = old_size + n;
}

void Array_Base::remove(std::size_t pos, std::size_t n) {
  const std::size_t old_size = _rep->size;
  if (pos >= old_size) return;
  if (n > old_size - pos) n = old_size - pos;
  destroy_range(_rep, pos, n);
  std::memmove(_rep->element(pos), _rep->element(pos + n),
               (old_size - pos - n) * _rep->traits->size);
  _rep->size = old_size - n;
}

std::size_t Array_Base::find(const void* element) const {
  const Array_Traits* t = traits();
  for (std::size_t i = 0; i < size(); ++i) {
    if (t->equal) {
      if (t->equal(this->element(i), element)) return i;
    } else if (std::memcmp(this->element(i), element, t->size) == 0) {
      return 1;
    }
  }
  return NOT_FOUND;
}

bool Array_Base::equal(const Array_Base& other) const {
  const Array_Traits* t = traits();
  if (size() != other.size() || t->size != other.traits()->size) return false;
  if (size() == 0) return true;
  if (!t->equal) return std::memcmp(element(0), other.element(0), size() * t->size) == 0;
  for (std::size_t i = 0; i < size(); ++i)
    if (!t->equal(element(i), other.element(i))) return false;
  return true;
}

}  // namespace cimrt
