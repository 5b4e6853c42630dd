// The trace log. It is set up once in a process, so each test runs its calls in a child.
#include "runtime/Log.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <chrono>
#include <csignal>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <functional>
#include <sstream>
#include <string>
#include <thread>
#include <utility>

#include "Test_Schema.h"
#include "runtime/File_Lock.h"
#include "runtime/Value.h"

namespace cimrt {
namespace {

namespace fs = std::filesystem;

/// A home directory of its own per test.
class Log_Test : public testing::Test {
 protected:
  Log_Test() {
    char name[] = "/tmp/runtime_log_test.XXXXXX";
    _home = mkdtemp(name);
    setenv("CIMRT_HOME", _home.c_str(), 1);
  }
  ~Log_Test() override {
    unsetenv("CIMRT_HOME");
    fs::remove_all(_home);
  }

  void write_rc(const std::string& text) { std::ofstream(_home / ".cimrtrc") << text; }
  const fs::path& home() const { return _home; }
  fs::path messages() const { return _home / ".cimrt" / "messages"; }

  std::string logged() const {
    std::ostringstream text;
    text << std::ifstream(messages()).rdbuf();
    return text.str();
  }

  /// Runs `work` in a child process.
  static void in_child(const std::function<void()>& work) {
    const pid_t child = fork();
    ASSERT_GE(child, 0);
    if (child == 0) {
      work();
      _exit(testing::Test::HasFailure() ? 1 : 0);
    }
    int status = 0;
    ASSERT_EQ(waitpid(child, &status, 0), child);
    ASSERT_TRUE(WIFEXITED(status) && WEXITSTATUS(status) == 0);
  }

  /// What the log holds after one line of each level.
  std::string log_every_level() {
    in_child([] {
      for (int level = LOG_FATAL_; level <= LOG_DBG_; ++level)
        log(level, "file.cpp", 5, "level %d", level);
    });
    return logged();
  }

 private:
  fs::path _home;
};

std::size_t lines_in(const std::string& text) {
  return static_cast<std::size_t>(std::count(text.begin(), text.end(), '\n'));
}

TEST_F(Log_Test, WithoutTheVariableNothingIsLoggedEver) {
  write_rc("LOG_LEVEL=DBG\n");
  in_child([this] {
    unsetenv("CIMRT_HOME");
    log(LOG_FATAL_, "file.cpp", 1, "first");
    setenv("CIMRT_HOME", home().c_str(), 1);
    log(LOG_FATAL_, "file.cpp", 1, "second");
  });
  EXPECT_FALSE(fs::exists(home() / ".cimrt"));
}

TEST_F(Log_Test, WithoutAnRcFileNothingIsLogged) {
  EXPECT_EQ(log_every_level(), "");
  EXPECT_FALSE(fs::exists(home() / ".cimrt"));
}

TEST_F(Log_Test, ACommentThatNamesTheLevelIsSkipped) {
  write_rc("#LOG_LEVEL=DBG\n\n  \nOTHER=1\nLOG_LEVEL = info  \nLOG_LEVEL=FATAL\n");
  const std::string text = log_every_level();
  EXPECT_EQ(lines_in(text), 4u);
  EXPECT_NE(text.find("INFO: "), std::string::npos);
  EXPECT_EQ(text.find("DBG: "), std::string::npos);
}

TEST_F(Log_Test, AnUnknownLevelGivesNoLogging) {
  write_rc("LOG_LEVEL=LOUD\nLOG_LEVEL=DBG\n");
  EXPECT_EQ(log_every_level(), "");
}

TEST_F(Log_Test, AnRcFileWithoutALevelGivesNoLogging) {
  write_rc("LOG_LEVELS=DBG\nlog_level=DBG\nLOG_LEVEL DBG\n LOG_LEVEL=DBG\n");
  EXPECT_EQ(log_every_level(), "");
}

TEST_F(Log_Test, AWarningIsDroppedAtLevelErr) {
  write_rc("LOG_LEVEL=ERR\n");
  const std::string text = log_every_level();
  EXPECT_EQ(lines_in(text), 2u);
  EXPECT_EQ(text.find("WARN"), std::string::npos);
}

TEST_F(Log_Test, ALineHasDateLevelPlaceAndText) {
  write_rc("LOG_LEVEL=DBG\n");
  in_child([] { log(LOG_WARN_, "file.cpp", 12, "number %d", 7); });
  EXPECT_THAT(logged(),
              testing::MatchesRegex("[0-9]{4}/[0-9]{2}/[0-9]{2} [0-9]{2}:[0-9]{2}:[0-9]{2} WARN: "
                                    "file.cpp\\(12\\): number 7\n"));
}

TEST_F(Log_Test, ANewlineIsAddedOnlyWhereThereIsNone) {
  write_rc("LOG_LEVEL=DBG\n");
  in_child([] {
    log(LOG_WARN_, "f", 1, "with\n");
    log(LOG_WARN_, "f", 1, "without");
    log(LOG_WARN_, "f", 1, "%s", std::string(10000, 'x').c_str());
  });
  EXPECT_EQ(lines_in(logged()), 3u);
  EXPECT_EQ(logged().find("\n\n"), std::string::npos);
}

TEST_F(Log_Test, ALineOfExactlyTheCapacityGetsItsNewline) {
  write_rc("LOG_LEVEL=DBG\n");
  in_child([] {
    for (std::size_t n = 4000; n < 4130; ++n)
      log(LOG_WARN_, "f", 1, "%s", std::string(n, 'x').c_str());
  });
  EXPECT_EQ(lines_in(logged()), 130u);
}

TEST_F(Log_Test, TheSetLevelCountsFromThenOn) {
  write_rc("LOG_LEVEL=ERR\n");
  in_child([] {
    log(LOG_WARN_, "f", 1, "dropped");
    EXPECT_EQ(log_set_level("warn"), 0);
    EXPECT_EQ(log_set_level("loud"), -1);
    log(LOG_WARN_, "f", 1, "written");
    _log_call({LOG_ERR_, "g", 2}, "called %d", 3);
  });
  EXPECT_EQ(logged().find("dropped"), std::string::npos);
  EXPECT_NE(logged().find("WARN: f(1): written\n"), std::string::npos);
  EXPECT_NE(logged().find("ERR: g(2): called 3\n"), std::string::npos);
}

TEST_F(Log_Test, TheLockFileIsForItsOwnerAlone) {
  write_rc("LOG_LEVEL=DBG\n");
  log_every_level();
  struct stat st = {};
  ASSERT_EQ(stat((messages().string() + ".lock").c_str(), &st), 0);
  EXPECT_EQ(st.st_mode & 0777u, 0600u);
}

TEST_F(Log_Test, LinksInADirectoryThatIsOpenToEveryoneAreNotFollowed) {
  write_rc("LOG_LEVEL=DBG\n");
  fs::create_directory(home() / ".cimrt");
  fs::permissions(home() / ".cimrt", fs::perms::all);
  const fs::path lock = messages().string() + ".lock";
  fs::create_symlink(home() / "made by a lock", lock);
  EXPECT_EQ(log_every_level(), "");
  EXPECT_FALSE(fs::exists(home() / "made by a lock"));
  fs::remove(lock);
  fs::create_symlink(home() / "made by the log", messages());
  EXPECT_EQ(log_every_level(), "");
  EXPECT_FALSE(fs::exists(home() / "made by the log"));
  fs::remove(messages());
  EXPECT_EQ(lines_in(log_every_level()), 5U) << "without links it logs";
}

TEST_F(Log_Test, TheDirectoryIsOpenToEveryoneWhomTheMaskAllows) {
  write_rc("LOG_LEVEL=DBG\n");
  in_child([] {
    umask(0);
    log(LOG_FATAL_, "file.cpp", 1, "text");
  });
  struct stat st = {};
  ASSERT_EQ(stat((home() / ".cimrt").c_str(), &st), 0);
  EXPECT_EQ(st.st_mode & 0777u, 0777u);
}

TEST_F(Log_Test, SpaceAroundTheEqualsSignAndBehindTheLevelIsSkipped) {
  write_rc("LOG_LEVEL \t=\t  WARN \t\r\n");
  EXPECT_EQ(lines_in(log_every_level()), 3u);
}

TEST_F(Log_Test, ALevelBehindALongCommentIsRead) {
  write_rc("#" + std::string(1000, 'x') + "\nLOG_LEVEL=ERR\n");
  EXPECT_EQ(lines_in(log_every_level()), 2u);
}

TEST_F(Log_Test, TheRestOfALineBeyond1023CharactersIsNoLine) {
  const std::string comment = "#" + std::string(1022, 'x');
  ASSERT_EQ(comment.size(), 1023U);
  write_rc(comment + "LOG_LEVEL = dbg\nLOG_LEVEL = warn\n");
  EXPECT_EQ(lines_in(log_every_level()), 3U) << "fatal, err and warn";
}

TEST_F(Log_Test, ALevelBefore2000BlanksIsRead) {
  write_rc("LOG_LEVEL = info" + std::string(2000, ' ') + "\n");
  EXPECT_EQ(lines_in(log_every_level()), 4U);
}

TEST_F(Log_Test, ALineOf1023CharactersWithoutAnEndIsTheLast) {
  write_rc("#" + std::string(1022, 'x'));
  EXPECT_EQ(log_every_level(), "");
}

TEST_F(Log_Test, AnExistingDirectoryAndLogAreContinued) {
  write_rc("LOG_LEVEL=FATAL\n");
  log_every_level();
  log_every_level();
  EXPECT_EQ(lines_in(logged()), 2u);
}

TEST_F(Log_Test, WithoutAUsableLockFileNothingIsLogged) {
  write_rc("LOG_LEVEL=DBG\n");
  fs::create_directories(messages().string() + ".lock");
  EXPECT_EQ(log_every_level(), "");
  EXPECT_FALSE(fs::exists(messages()));
}

TEST_F(Log_Test, WithoutAWritableLogNothingIsLogged) {
  write_rc("LOG_LEVEL=DBG\n");
  fs::create_directories(messages());
  in_child([] { log(LOG_FATAL_, "f", 1, "text"); });
  EXPECT_TRUE(fs::is_directory(messages()));
}

TEST_F(Log_Test, AHomeTooLongForAPathGivesNoLogging) {
  in_child([] {
    setenv("CIMRT_HOME", std::string(2000, 'x').c_str(), 1);
    log(LOG_FATAL_, "f", 1, "text");
  });
  EXPECT_FALSE(fs::exists(home() / ".cimrt"));
}

TEST_F(Log_Test, SwitchedOffTheTraceMacroWritesNothing) {
  write_rc("LOG_LEVEL=DBG\n");
  in_child([] {
    EXPECT_EQ(log_enable(true), -1);
    EXPECT_EQ(log_enable(false), 0);
    EXPECT_EQ(log_enable(false), -1);
    CIMRT_TRACE(LOG_WARN_, "hidden");
    EXPECT_EQ(log_enable(true), 0);
    CIMRT_TRACE(LOG_WARN_, "shown");
  });
  EXPECT_EQ(logged().find("hidden"), std::string::npos);
  EXPECT_NE(logged().find("shown"), std::string::npos);
}

TEST_F(Log_Test, TwoProcessesWriteWholeLines) {
  write_rc("LOG_LEVEL=DBG\n");
  in_child([] {
    const pid_t second = fork();
    for (int i = 0; i < 200; ++i) log(LOG_INFO_, "f", 1, "%s", std::string(300, 'y').c_str());
    if (second == 0) _exit(0);
    waitpid(second, nullptr, 0);
  });
  std::istringstream lines(logged());
  std::size_t count = 0;
  for (std::string line; std::getline(lines, line); ++count)
    EXPECT_EQ(line.size(), std::string("2001/02/03 04:05:06 INFO: f(1): ").size() + 300);
  EXPECT_EQ(count, 400u);
}

TEST_F(Log_Test, RefusedValuesAreLoggedAsWarnings) {
  write_rc("LOG_LEVEL=WARN\n");
  in_child([] {
    using namespace test;
    const Ref<T_Port_Link> link = make<T_Port_Link>();
    const Meta_Feature* end = find_feature(link->meta_class, "Dependent");
    Value value;
    value.set(nullptr, end);
    value.set(std::uint8_t{1});
    value.set(link.get(), end);
    value.set(make_device("a", 1).release());
    value.set(link.get(), end);
  });
  EXPECT_NE(logged().find("null instance argument\n"), std::string::npos);
  EXPECT_NE(logged().find("type mismatch: T_Port_Link.Dependent\n"), std::string::npos);
  EXPECT_NE(logged().find("failed to assign instance of T_Device to T_Port_Link.Dependent\n"),
            std::string::npos);
  EXPECT_EQ(lines_in(logged()), 3u);
}

TEST(LogLevel, IsFoundByNameInAnyCase) {
  const char* const names[] = {"FATAL", "err", "Warn", "INFO", "dbg"};
  for (int i = 0; i < 5; ++i) {
    int level = -5;
    EXPECT_EQ(string_to_log_level(names[i], level), 0);
    EXPECT_EQ(level, i);
  }
  int level = 77;
  EXPECT_EQ(string_to_log_level("", level), -1);
  EXPECT_EQ(string_to_log_level("DEBUG", level), -1);
  EXPECT_EQ(level, 77);
}

/// How a thread of this process stands in the system: state letter and voluntary switches so far.
struct Thread_State {
  char letter = '?';
  unsigned long switches = 0;
};

Thread_State state_of(pid_t thread) {
  std::ifstream status("/proc/self/task/" + std::to_string(thread) + "/status");
  Thread_State state;
  std::string word;
  while (status >> word) {
    if (word == "State:") status >> state.letter;
    if (word == "voluntary_ctxt_switches:") status >> state.switches;
  }
  return state;
}

/// Waits until the thread sleeps again after `before` switches; false after ten seconds.
bool sleeps_after(pid_t thread, unsigned long before) {
  const auto end = std::chrono::steady_clock::now() + std::chrono::seconds(10);
  while (std::chrono::steady_clock::now() < end) {
    const Thread_State state = state_of(thread);
    if (state.letter == 'S' && state.switches > before) return true;
    std::this_thread::yield();
  }
  return false;
}

/// A child process that holds the lock of a file until told to end.
class Lock_Holder {
 public:
  explicit Lock_Holder(const char* path) {
    int ready[2];
    if (pipe(ready) != 0 || pipe(_end) != 0) std::abort();
    _child = fork();
    if (_child == 0) {
      File_Lock lock(path);
      lock.lock();
      char byte = 'r';
      const bool told = write(ready[1], &byte, 1) == 1 && read(_end[0], &byte, 1) == 1;
      _exit(told ? 0 : 1);  // which frees the lock
    }
    char byte = 0;
    _held = read(ready[0], &byte, 1) == 1;
    for (const int fd : {ready[0], ready[1], _end[0]}) close(fd);
  }
  ~Lock_Holder() { release(); }
  Lock_Holder(const Lock_Holder&) = delete;
  Lock_Holder& operator=(const Lock_Holder&) = delete;

  bool held() const { return _held; }
  void release() {
    if (_child <= 0) return;
    EXPECT_EQ(write(_end[1], "e", 1), 1);
    close(_end[1]);
    EXPECT_EQ(waitpid(std::exchange(_child, 0), nullptr, 0) > 0, true);
  }

 private:
  pid_t _child = 0;
  int _end[2] = {-1, -1};
  bool _held = false;
};

TEST(FileLock, SignalsDoNotEndTheWait) {
  char path[] = "/tmp/runtime_lock_test.XXXXXX";
  close(mkstemp(path));
  Lock_Holder holder(path);
  ASSERT_TRUE(holder.held());
  struct sigaction interrupting = {};
  interrupting.sa_handler = [](int) {};  // without SA_RESTART the wait fails with EINTR
  struct sigaction before = {};
  sigaction(SIGUSR1, &interrupting, &before);

  std::atomic<pid_t> id{0};
  std::atomic<bool> locked{false};
  std::thread waiter([&] {
    File_Lock lock(path);
    id = gettid();
    lock.lock();
    locked = true;
    lock.unlock();
  });
  while (id == 0) std::this_thread::yield();
  unsigned long switches = 0;
  for (int round = 0; round < 3 && !locked; ++round) {
    ASSERT_TRUE(sleeps_after(id, switches)) << "round " << round;
    EXPECT_FALSE(locked) << "the other process still holds the lock";
    switches = state_of(id).switches;
    pthread_kill(waiter.native_handle(), SIGUSR1);
  }
  EXPECT_TRUE(sleeps_after(id, switches)) << "it waits again behind the last signal";
  EXPECT_FALSE(locked);
  holder.release();
  waiter.join();
  EXPECT_TRUE(locked);
  sigaction(SIGUSR1, &before, nullptr);
  fs::remove(path);
}

TEST(FileLock, OfAFileThatCannotBeOpenedDoesNothing) {
  File_Lock lock("/nonexistent/directory/lock");
  EXPECT_FALSE(lock.usable());
  lock.lock();
  lock.unlock();
}

}  // namespace
}  // namespace cimrt
