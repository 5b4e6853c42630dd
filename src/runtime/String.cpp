#include "runtime/String.h"

#include <strings.h>

#include <bit>
#include <cstring>
#include <new>
#include <stdexcept>
#include <utility>

#include "runtime/Types.h"

namespace cimrt {
namespace {

constexpr std::size_t MIN_CAP = 32;
constexpr std::size_t MAX_CAP = std::size_t{1} << 31;

/// Capacity taken for `n` requested characters.
std::size_t cap_for(std::size_t n) {
  if (n < MIN_CAP) return MIN_CAP;
  if (n > MAX_CAP) throw std::length_error("text too long");
  return std::bit_ceil(n);
}

StringRep* allocate(std::size_t cap) {
  void* block = ::operator new(offsetof(StringRep, data) + cap + 1);
  auto* rep = ::new (block) StringRep;
  rep->refs.store(1, std::memory_order_relaxed);
  rep->size = 0;
  rep->cap = static_cast<std::uint32_t>(cap);
  return rep;
}

char* text_of(StringRep* rep) {
  return reinterpret_cast<char*>(rep) + offsetof(StringRep, data);
}

void set_size(StringRep* rep, std::size_t size) {
  rep->size = static_cast<std::uint32_t>(size);
  text_of(rep)[size] = '\0';
}

/// A rep of capacity `cap` that holds the concatenation of two texts.
StringRep* make(std::size_t cap, std::string_view a, std::string_view b = {}) {
  StringRep* rep = allocate(cap);
  if (!a.empty()) std::memcpy(text_of(rep), a.data(), a.size());
  if (!b.empty()) std::memcpy(text_of(rep) + a.size(), b.data(), b.size());
  set_size(rep, a.size() + b.size());
  return rep;
}

std::string_view view_of(const char* text) {
  return text ? std::string_view(text) : std::string_view();
}

}  // namespace

constinit StringRep String::_empty = {2, 0, 0, {'\0'}};

StringRep* String::make_rep(std::string_view text) {
  return text.empty() ? &_empty : make(cap_for(text.size()), text);
}

void String::release(StringRep* rep) noexcept {
  if (rep == &_empty) return;
  if (rep->refs.fetch_sub(1, std::memory_order_acq_rel) != 1) return;
  rep->~StringRep();
  ::operator delete(rep);
}

bool String::is_sole_owner() const noexcept {
  return _rep->refs.load(std::memory_order_acquire) == 1;
}

void String::replace_rep(StringRep* rep) noexcept {
  release(std::exchange(_rep, rep));
}

void String::make_private() {
  if (!is_sole_owner()) replace_rep(make(cap_for(_rep->cap), view()));
}

String::String(const char* text) : _rep(make_rep(view_of(text))) {}

String::String(const char* text, std::size_t n) : _rep(make_rep({text, n})) {}

String::String(std::string_view text) : _rep(make_rep(text)) {}

String::String(const char* a, const char* b) : String(a) {
  append(b);
}

String::String(const char* a, const char* b, const char* c) : String(a, b) {
  append(c);
}

String::String(const String& other, std::size_t pos, std::size_t n)
    : _rep(make_rep(other.slice(pos, n))) {}

// NOLINTNEXTLINE(bugprone-unhandled-self-assignment): taking before dropping is safe on itself too
String& String::operator=(const String& other) noexcept {
  StringRep* rep = other._rep;
  retain(rep);
  replace_rep(rep);
  return *this;
}

String& String::operator=(String&& other) noexcept {
  std::swap(_rep, other._rep);
  return *this;
}

String& String::operator=(const char* text) {
  assign(text);
  return *this;
}

void String::assign(const String& other) noexcept {
  *this = other;
}

void String::assign(const char* text) {
  const std::string_view t = view_of(text);
  assign(t.data(), t.size());
}

void String::assign(const char* text, std::size_t n) {
  if (n > _rep->cap || !is_sole_owner()) {
    replace_rep(make_rep({text, n}));
    return;
  }
  if (n != 0) std::memmove(text_of(_rep), text, n);
  set_size(_rep, n);
}

void String::clear() {
  if (_rep->size == 0) return;
  if (is_sole_owner()) {
    set_size(_rep, 0);
  } else {
    replace_rep(&_empty);
  }
}

void String::reserve(std::size_t n) {
  if (_rep->cap >= n && is_sole_owner()) return;
  replace_rep(make(cap_for(n < _rep->size ? _rep->size : n), view()));
}

void String::append(char c) {
  if (_rep->size == _rep->cap || !is_sole_owner()) {
    const std::size_t cap = _rep->cap == 0 ? MIN_CAP : cap_for(std::size_t{_rep->cap} * 2);
    replace_rep(make(cap, view()));
  }
  text_of(_rep)[_rep->size] = c;
  set_size(_rep, std::size_t{_rep->size} + 1);
}

void String::append(const char* text) {
  const std::string_view t = view_of(text);
  append(t.data(), t.size());
}

void String::append(const char* text, std::size_t n) {
  const std::size_t new_size = _rep->size + n;
  const std::size_t cap = cap_for(new_size);
  if (_rep->cap < cap || !is_sole_owner()) {
    // The old rep lives until the text is copied: the text may be part of it.
    replace_rep(make(cap, view(), {text, n}));
    return;
  }
  if (n != 0) std::memmove(text_of(_rep) + _rep->size, text, n);
  set_size(_rep, new_size);
}

void String::append(const String& other) {
  append(other.c_str(), other.size());
}

void String::remove(std::size_t pos, std::size_t n) {
  make_private();
  const std::size_t size = _rep->size;
  if (pos >= size) return;
  if (n > size - pos) n = size - pos;
  std::memmove(text_of(_rep) + pos, text_of(_rep) + pos + n, size - pos - n);
  set_size(_rep, size - n);
}

void String::set(std::size_t i, char c) {
  make_private();
  if (i < _rep->size) text_of(_rep)[i] = c;
}

std::string_view String::slice(std::size_t pos, std::size_t n) const noexcept {
  return pos < size() ? view().substr(pos, n) : std::string_view();
}

String String::substr(std::size_t pos, std::size_t n) const {
  return String(*this, pos, n);
}

std::size_t String::find(const String& text) const {
  return view().find(text.view());
}

std::size_t String::find(const char* text) const {
  return view().find(view_of(text));
}

std::size_t String::find(char c) const {
  return view().find(c);
}

std::size_t String::find(char c, std::size_t pos) const {
  return view().find(c, pos);
}

bool String::equal(const String& other) const noexcept {
  return _rep == other._rep || view() == other.view();
}

bool String::equal(const char* text) const noexcept {
  return std::strcmp(c_str(), text ? text : "") == 0;
}

bool String::equal(const char* text, std::size_t n) const noexcept {
  return view() == std::string_view(text, n);
}

bool String::equal(char c) const noexcept {
  return size() == 1 && (*this)[0] == c;
}

bool String::equali(const String& other) const noexcept {
  return equali(other.c_str(), other.size());
}

bool String::equali(const char* text) const noexcept {
  return name_eq(c_str(), text ? text : "");
}

bool String::equali(const char* text, std::size_t n) const noexcept {
  return size() == n && (n == 0 || strncasecmp(c_str(), text, n) == 0);
}

}  // namespace cimrt
