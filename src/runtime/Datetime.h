// CIM timestamp or interval, from and to the 25-character CIM text.
#pragma once

#include <atomic>
#include <cstddef>
#include <cstdint>
#include <cstdio>

namespace cimrt {

struct DatetimeRep {
  std::atomic<std::uint32_t> refs;
  std::uint64_t usec;  ///< interval: total microseconds; timestamp: microseconds since the epoch
  std::int32_t utc;    ///< offset from UTC in minutes, timestamps only
  std::int32_t is_timestamp;  ///< 0 interval, 1 timestamp
};

/// One-pointer date and time value, shared by reference count like `String`.
class Datetime {
 public:
  /// Room that `ascii` needs, NUL included.
  static constexpr std::size_t ASCII_SIZE = 64;

  Datetime();                                      ///< the zero interval
  explicit Datetime(std::uint64_t usec);           ///< an interval
  Datetime(std::uint64_t usec, std::int32_t utc);  ///< a timestamp
  explicit Datetime(const char* text);             ///< zero interval if the text is refused
  Datetime(const Datetime& other) noexcept;
  ~Datetime();
  Datetime& operator=(const Datetime& other) noexcept;

  static Datetime now();

  /// Parses the 25-character text. False, with the value left as a private rep, if it is refused.
  bool set(const char* text);
  void set_interval(std::uint32_t days, std::uint32_t hours, std::uint32_t minutes,
                    std::uint32_t seconds, std::uint32_t microseconds);
  void set_timestamp(std::uint32_t year, std::uint32_t month, std::uint32_t day,
                     std::uint32_t hours, std::uint32_t minutes, std::uint32_t seconds,
                     std::uint32_t microseconds, std::int32_t utc);
  void get_interval(std::uint32_t& days, std::uint32_t& hours, std::uint32_t& minutes,
                    std::uint32_t& seconds, std::uint32_t& microseconds) const;
  void get_timestamp(std::uint32_t& year, std::uint32_t& month, std::uint32_t& day,
                     std::uint32_t& hours, std::uint32_t& minutes, std::uint32_t& seconds,
                     std::uint32_t& microseconds, std::int32_t& utc) const;

  bool is_timestamp() const noexcept { return _rep->is_timestamp != 0; }
  bool is_interval() const noexcept { return _rep->is_timestamp == 0; }
  std::uint64_t usec() const noexcept { return _rep->usec; }
  std::int32_t utc() const noexcept { return _rep->utc; }
  void usec(std::uint64_t value);
  void utc(std::int32_t value);
  void clear();  ///< back to the zero interval

  /// Writes the CIM text, or with `prettify` the readable one, into `buffer` of `ASCII_SIZE`.
  void ascii(char* buffer, bool prettify) const;
  void print(std::FILE* stream, bool prettify) const;

  /// Equal on `usec`, `utc` and the interval flag.
  bool equal(const Datetime& other) const noexcept;

 private:
  static void release(DatetimeRep* rep) noexcept;
  void make_private();
  void store(std::uint64_t usec, std::int32_t utc, std::int32_t is_timestamp);
  bool set_interval_text(const char* text);
  bool set_timestamp_text(const char* text);
  void interval_ascii(char* buffer, bool prettify) const;
  void timestamp_ascii(char* buffer, bool prettify) const;

  DatetimeRep* _rep;
};

inline bool operator==(const Datetime& a, const Datetime& b) noexcept {
  return a.equal(b);
}

}  // namespace cimrt
