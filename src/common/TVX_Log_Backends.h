// Back ends of the provider's logger: log file, records in memory, system log.
#pragma once

#include <atomic>
#include <cstdint>
#include <cstdio>
#include <string>
#include <vector>

#include "runtime/Datetime.h"
#include "runtime/Threads.h"

namespace cimrt {

/// One back end. It looks at the logger's mode by itself, registers with the logger while it lives,
/// may be called from several threads at once and never logs.
class TVX_LoggerInterface {
 public:
  virtual ~TVX_LoggerInterface() = default;
  /// Takes one message. `line` may be null (counts as 0), `text` may be null.
  virtual void log(int level, const char* file, const unsigned* line, const char* text) = 0;
  virtual void open() = 0;
  virtual void close() = 0;
  virtual void clear() = 0;
};

/// Writes lines to a file, in modes 2 and 4.
class TVX_FileLogger : public TVX_LoggerInterface {
 public:
  TVX_FileLogger();            ///< registers itself with the logger
  ~TVX_FileLogger() override;  ///< leaves the logger and closes the stream
  TVX_FileLogger(const TVX_FileLogger&) = delete;
  TVX_FileLogger& operator=(const TVX_FileLogger&) = delete;

  void log(int level, const char* file, const unsigned* line, const char* text) override;
  /// In modes 2 and 4: closes the stream and opens the path, if there is one, for appending.
  void open() override;
  /// Closes the stream, if open, and forgets the path.
  void close() override;
  /// Empties the file of an open stream.
  void clear() override;

  /// Opens `path` for appending and takes it as the log file. Nothing changes on failure.
  /// @param restricted lets only `TVX_CRIT` and `TVX_ERR` lines through
  /// @return 0, or -1 for a null path, something that is no regular file, or a failed open
  int validateAndSetPath(const char* path, bool restricted);

  std::string path() const;  ///< the present path, empty if there is none
  bool isRestricted() const;
  bool isOpen() const;

 private:
  void closeStream();

  mutable Mutex m_Mutex;  // guards everything below
  std::string m_Path;
  std::FILE* m_File = nullptr;
  bool m_bRestricted = false;
};

/// Keeps the newest records of levels 1 to 3 in memory, in modes 1 and 4.
class TVX_CIMLogger : public TVX_LoggerInterface {
 public:
  static constexpr std::int32_t DEFAULT_CAPACITY = 1024;
  static constexpr std::size_t TEXT_SIZE = 200;

  /// One kept message.
  struct Record {
    std::int32_t level = 0;
    Datetime time;
    char text[TEXT_SIZE] = {};  ///< "[message]", cut to the field, NUL-terminated
  };

  explicit TVX_CIMLogger(std::int32_t capacity = DEFAULT_CAPACITY);  ///< registers itself
  ~TVX_CIMLogger() override;
  TVX_CIMLogger(const TVX_CIMLogger&) = delete;
  TVX_CIMLogger& operator=(const TVX_CIMLogger&) = delete;

  void log(int level, const char* file, const unsigned* line, const char* text) override;
  void open() override {}
  void close() override {}
  void clear() override;

  /// A copy of the records, in the order of the ring's slots.
  std::vector<Record> records() const;
  std::int32_t capacity() const { return m_Capacity; }
  /// The count of records taken since the last `clear`, less one.
  std::int32_t lastIndex() const;

 private:
  const std::int32_t m_Capacity;
  mutable Mutex m_Mutex;  // guards everything below
  std::int32_t m_LastIndex = -1;
  std::vector<Record> m_Records;
};

/// The system log. Its filter passes none of the levels in use.
class TVX_SysLogger : public TVX_LoggerInterface {
 public:
  TVX_SysLogger();            ///< opens the system log and registers itself with the logger
  ~TVX_SysLogger() override;  ///< leaves the logger and closes the system log
  TVX_SysLogger(const TVX_SysLogger&) = delete;
  TVX_SysLogger& operator=(const TVX_SysLogger&) = delete;

  void log(int level, const char* file, const unsigned* line, const char* text) override;
  void open() override {}
  void close() override {}
  void clear() override {}
};

}  // namespace cimrt
