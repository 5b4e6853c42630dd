#include "runtime/Log.h"

#include <pthread.h>
#include <sys/stat.h>

#include <cctype>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <iterator>
#include <memory>
#include <optional>
#include <utility>

#include "runtime/Buffer.h"
#include "runtime/Conversions.h"
#include "runtime/Datetime.h"
#include "runtime/File_Lock.h"
#include "runtime/Safe_Open.h"
#include "runtime/Types.h"

namespace cimrt {

constinit std::atomic<bool> _log_enabled_state{true};

namespace {

constexpr const char* HOME_VARIABLE = "CIMRT_HOME";
constexpr const char* LOG_NAME = ".cimrt";
constexpr const char* LEVEL_KEY = "LOG_LEVEL";
constexpr std::size_t PATH_SIZE = 1024;
constexpr std::size_t LINE_SIZE = 1024;
constexpr mode_t DIRECTORY_MODE = 0777;

constexpr const char* level_names[] = {"FATAL", "ERR", "WARN", "INFO", "DBG"};

/// State of the log, guarded by `mutex`. Stays until the library is taken out of the process.
pthread_mutex_t mutex = PTHREAD_MUTEX_INITIALIZER;
bool initialised = false;
int current_level = LOG_FATAL_;
std::FILE* log_file = nullptr;
File_Lock* file_lock = nullptr;

class Log_Guard {
 public:
  Log_Guard() { pthread_mutex_lock(&mutex); }
  ~Log_Guard() { pthread_mutex_unlock(&mutex); }
  Log_Guard(const Log_Guard&) = delete;
  Log_Guard& operator=(const Log_Guard&) = delete;
};

struct Close_File {
  void operator()(std::FILE* file) const { std::fclose(file); }
};
using File = std::unique_ptr<std::FILE, Close_File>;

/// A path of bounded length; a longer one counts as unusable.
class Path {
 public:
  explicit Path(const char* start) { append(start); }
  Path& append(const char* text) {
    _cut = _cut || str_lcat(_text, text, sizeof _text) >= sizeof _text;
    return *this;
  }
  bool usable() const { return !_cut; }
  const char* c_str() const { return _text; }

 private:
  char _text[PATH_SIZE] = "";
  bool _cut = false;
};

const char* skip_space(const char* p) {
  while (std::isspace(static_cast<unsigned char>(*p))) ++p;
  return p;
}

void strip_trailing_space(char* line) {
  std::size_t n = std::strlen(line);
  while (n > 0 && std::isspace(static_cast<unsigned char>(line[n - 1]))) line[--n] = '\0';
}

/// The level text of a line "LOG_LEVEL = text", or null.
const char* level_text(char* line) {
  if (*line == '#') return nullptr;
  strip_trailing_space(line);
  const std::size_t n = std::strlen(LEVEL_KEY);
  if (std::strncmp(line, LEVEL_KEY, n) != 0) return nullptr;
  const char* p = skip_space(line + n);
  return *p == '=' ? skip_space(p + 1) : nullptr;
}

/// Drops what is left of a line that was longer than its place: it is no line of its own.
void skip_rest_of_line(const char* line, std::FILE* file) {
  if (std::strchr(line, '\n')) return;
  for (int c = std::fgetc(file); c != '\n' && c != EOF; c = std::fgetc(file)) {
  }
}

/// The level that the rc file sets in its first line of that kind; none if there is no such line or
/// no such level.
std::optional<int> read_level(const Path& rc) {
  const File file(rc.usable() ? std::fopen(rc.c_str(), "re") : nullptr);
  if (!file) return std::nullopt;
  char line[LINE_SIZE];
  while (std::fgets(line, sizeof line, file.get())) {
    skip_rest_of_line(line, file.get());
    const char* text = level_text(line);
    if (!text) continue;
    int level = 0;
    if (string_to_log_level(text, level) != 0) return std::nullopt;
    return level;
  }
  return std::nullopt;
}

/// Opens the log and its lock file in the log directory of `home`; both or none.
void open_log(const char* home) {
  Path directory = Path(home).append("/").append(LOG_NAME);
  const Path messages = Path(directory).append("/messages");
  const Path lock = Path(messages).append(".lock");
  if (!lock.usable()) return;
  mkdir(directory.c_str(), DIRECTORY_MODE);
  auto locked = std::make_unique<File_Lock>(lock.c_str());
  if (!locked->usable()) return;
  log_file = open_for_writing(messages.c_str(), "a", LOG_PERMISSIONS);
  if (log_file) file_lock = locked.release();
}

/// Runs at the first log call only: a log that could not be opened then stays shut.
void set_up() {
  const char* home = secure_getenv(HOME_VARIABLE);
  if (!home) return;
  const std::optional<int> level = read_level(Path(home).append("/").append(LOG_NAME).append("rc"));
  if (!level) return;
  current_level = *level;
  open_log(home);
}

/// Runs behind the last destructor of the library. What a thread that is still at work logs after
/// it is lost.
[[gnu::destructor]] void close_log() {
  const Log_Guard guard;
  delete std::exchange(file_lock, nullptr);
  if (log_file) std::fclose(std::exchange(log_file, nullptr));
  initialised = true;
}

/// Date and time without the fraction of the second.
void write_date(char (&text)[Datetime::ASCII_SIZE]) {
  Datetime::now().ascii(text, true);
  if (char* dot = std::strchr(text, '.')) *dot = '\0';
}

const char* level_name(int level) {
  return level_names[level >= LOG_FATAL_ && level <= LOG_DBG_ ? level : LOG_FATAL_];
}

void write_line(Buffer& line) {
  if (line.data()[line.size() - 1] != '\n') {
    if (line.size() == line.capacity()) line.grow();
    line.append('\n');
  }
  file_lock->lock();
  std::fwrite(line.data(), 1, line.size(), log_file);
  std::fflush(log_file);
  file_lock->unlock();
}

}  // namespace

int log_enable(bool flag) {
  return _log_enabled_state.exchange(flag) == flag ? -1 : 0;
}

int string_to_log_level(const char* name, int& out) {
  for (std::size_t i = 0; i < std::size(level_names); ++i) {
    if (!name_eq(level_names[i], name)) continue;
    out = static_cast<int>(i);
    return 0;
  }
  return -1;
}

int log_set_level(const char* name) {
  int level = 0;
  if (string_to_log_level(name, level) != 0) return -1;
  const Log_Guard guard;
  current_level = level;
  return 0;
}

void log(int level, const char* file, int line, const char* fmt, ...) {
  va_list args;
  va_start(args, fmt);
  vlog(level, file, line, fmt, args);
  va_end(args);
}

void _log_call(const Log_Call& call, const char* fmt, ...) {
  va_list args;
  va_start(args, fmt);
  vlog(call.level, call.file, call.line, fmt, args);
  va_end(args);
}

void vlog(int level, const char* file, int line, const char* fmt, va_list args) {
  const Log_Guard guard;
  if (!initialised) {
    set_up();
    initialised = true;
  }
  if (!log_file || level > current_level) return;
  char date[Datetime::ASCII_SIZE];
  write_date(date);
  Buffer text;
  text.format("%s %s: %s(%d): ", date, level_name(level), file, line);
  text.vformat(fmt, args);
  write_line(text);
}

}  // namespace cimrt
