// Text value with a shared, reference-counted representation.
#pragma once

#include <atomic>
#include <cstddef>
#include <cstdint>
#include <string_view>

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
/// and counts are bytes and are not checked unless told.
class String {
 public:
  /// "to the end" in `remove` and `substr`, "not found" in `find`.
  static constexpr std::size_t npos = static_cast<std::size_t>(-1);

  String() noexcept;
  String(const char* text);  ///< null counts as the empty text
  String(const char* text, std::size_t n);
  String(std::string_view text);
  String(const char* a, const char* b);
  String(const char* a, const char* b, const char* c);
  String(const String& other, std::size_t pos, std::size_t n);
  String(const String& other) noexcept;
  String(String&& other) noexcept;
  ~String();

  String& operator=(const String& other) noexcept;
  String& operator=(String&& other) noexcept;
  String& operator=(const char* text);

  void assign(const String& other) noexcept;  ///< shares the rep
  void assign(const char* text);              ///< reuses a private rep that is large enough
  void assign(const char* text, std::size_t n);
  void clear();
  void reserve(std::size_t n);
  void append(char c);
  void append(const char* text);
  void append(const char* text, std::size_t n);
  void append(const String& other);
  void remove(std::size_t pos, std::size_t n = npos);
  void set(std::size_t i, char c);
  String substr(std::size_t pos, std::size_t n = npos) const;

  const char* c_str() const noexcept { return _rep->data; }
  std::size_t size() const noexcept { return _rep->size; }
  std::size_t capacity() const noexcept { return _rep->cap; }
  bool empty() const noexcept { return _rep->size == 0; }
  char operator[](std::size_t i) const noexcept { return _rep->data[i]; }
  std::string_view view() const noexcept { return {_rep->data, _rep->size}; }

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
  static StringRep* empty_rep() noexcept;

 private:
  StringRep* _rep;
};

inline bool operator==(const String& a, const String& b) noexcept {
  return a.equal(b);
}
inline bool operator==(const String& a, const char* b) noexcept {
  return a.equal(b);
}

}  // namespace cimrt
