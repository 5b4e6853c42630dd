// Text value with a shared, reference-counted representation.
#pragma once

#include <atomic>
#include <cstddef>
#include <cstdint>
#include <string_view>
#include <utility>

namespace cimrt {

/// Shared representation behind a `String`. One `operator new` block: header, text, NUL.
struct StringRep {
  std::atomic<std::uint32_t> refs;  ///< number of `String`s that share this rep
  std::uint32_t size;               ///< characters, not counting the NUL
  std::uint32_t cap;                ///< characters that fit, not counting the NUL
  char data[1];                     ///< the text, always NUL-terminated
};

/// One-pointer text. Copies share the rep; any change first makes it private. A copy may be made
/// and dropped from any thread; changing one `String` object is for one thread at a time. Positions
/// and counts are bytes. Texts given as pointers may be part of the `String` that is changed.
///
/// Capacity: 32 for fewer than 32 characters, else the next power of two. A rep whose sole owner
/// changes it keeps its capacity; a shared rep is left to the others.
class String {
 public:
  /// "to the end" in `remove` and `substr`, "not found" in `find`.
  static constexpr std::size_t npos = static_cast<std::size_t>(-1);

  String() noexcept : _rep(&_empty) {}
  String(const char* text);  ///< null counts as the empty text
  String(const char* text, std::size_t n);
  String(std::string_view text);
  String(const char* a, const char* b);
  String(const char* a, const char* b, const char* c);
  String(const String& other, std::size_t pos, std::size_t n);
  String(const String& other) noexcept : _rep(other._rep) { retain(_rep); }
  String(String&& other) noexcept : _rep(std::exchange(other._rep, &_empty)) {}
  ~String() { release(_rep); }

  String& operator=(const String& other) noexcept;
  String& operator=(String&& other) noexcept;
  String& operator=(const char* text);

  void assign(const String& other) noexcept;  ///< shares the rep
  void assign(const char* text);              ///< reuses a private rep that is large enough
  void assign(const char* text, std::size_t n);
  void clear();                 ///< a private rep keeps its room
  void reserve(std::size_t n);  ///< also makes the rep private
  void append(char c);
  void append(const char* text);
  void append(const char* text, std::size_t n);
  void append(const String& other);
  /// Positions behind the end remove nothing; counts are cut to the end.
  void remove(std::size_t pos, std::size_t n = npos);
  /// Replaces character `i`; behind the end it changes nothing.
  void set(std::size_t i, char c);
  /// The text from `pos` on, at most `n` characters; empty behind the end.
  String substr(std::size_t pos, std::size_t n = npos) const;

  const char* c_str() const noexcept { return _rep->data; }
  std::size_t size() const noexcept { return _rep->size; }
  std::size_t capacity() const noexcept { return _rep->cap; }
  bool empty() const noexcept { return _rep->size == 0; }
  char operator[](std::size_t i) const noexcept { return _rep->data[i]; }
  std::string_view view() const noexcept { return {_rep->data, _rep->size}; }

  /// Position of the first occurrence, or `npos`.
  std::size_t find(const String& text) const;
  std::size_t find(const char* text) const;
  std::size_t find(char c) const;
  std::size_t find(char c, std::size_t pos) const;

  bool equal(const String& other) const noexcept;
  bool equal(const char* text) const noexcept;
  bool equal(const char* text, std::size_t n) const noexcept;
  bool equal(char c) const noexcept;
  bool equali(const String& other) const noexcept;
  bool equali(const char* text) const noexcept;
  bool equali(const char* text, std::size_t n) const noexcept;

  /// The rep, for tests of the sharing rule.
  const StringRep* rep() const noexcept { return _rep; }

  /// The shared empty rep, recognised by address and never counted or freed.
  static StringRep* empty_rep() noexcept { return &_empty; }

 private:
  static StringRep _empty;  ///< constant-initialised, so usable from any static initializer

  static void retain(StringRep* rep) noexcept {
    if (rep != &_empty) rep->refs.fetch_add(1, std::memory_order_relaxed);
  }
  static void release(StringRep* rep) noexcept;
  static StringRep* make_rep(std::string_view text);
  bool is_sole_owner() const noexcept;
  void replace_rep(StringRep* rep) noexcept;
  void make_private();
  std::string_view slice(std::size_t pos, std::size_t n) const noexcept;

  StringRep* _rep;
};

inline bool operator==(const String& a, const String& b) noexcept {
  return a.equal(b);
}
inline bool operator==(const String& a, const char* b) noexcept {
  return a.equal(b);
}

}  // namespace cimrt
