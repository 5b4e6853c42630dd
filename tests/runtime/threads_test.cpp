#include "runtime/Threads.h"

#include <gtest/gtest.h>
#include <pthread.h>

#include <cerrno>
#include <string>
#include <vector>

#include "runtime/Thread_Context.h"

namespace {

/// While set, no thread can be started.
bool refuse_threads = false;

}  // namespace

// The linker turns every call of pthread_create in this program into one of the first of these.
extern "C" {
int __real_pthread_create(pthread_t* id, const pthread_attr_t* attributes, void* (*proc)(void*),
                          void* arg);
int __wrap_pthread_create(pthread_t* id, const pthread_attr_t* attributes, void* (*proc)(void*),
                          void* arg) {
  return refuse_threads ? EAGAIN : __real_pthread_create(id, attributes, proc, arg);
}
}

namespace cimrt {
namespace {

/// What happened to the contexts of a test, in order.
struct Journal {
  Mutex mutex;
  std::vector<std::string> lines;

  void add(const std::string& line) {
    const Auto_Mutex locked(mutex);
    lines.push_back(line);
  }
};

class Test_Context : public Thread_Context {
 public:
  Test_Context(Journal& journal, std::string name) : _journal(journal), _name(std::move(name)) {}
  ~Test_Context() override { _journal.add(_name + " deleted"); }

  Thread_Context* thread_create_hook(void*) override {
    _journal.add(_name + " create");
    return new Test_Context(_journal, _name + "'");
  }
  void thread_start_hook() override { _journal.add(_name + " start"); }
  void thread_exit_hook() override { _journal.add(_name + " exit"); }

  void* instance_enumerator_create(const char*, const Instance*) override { return nullptr; }
  void instance_enumerator_destroy(void*) override {}
  bool instance_enumerator_more(void*) override { return false; }
  void instance_enumerator_next(void*) override {}
  Ref<Instance> instance_enumerator_get(void*) override { return Ref<Instance>(); }
  Ref<Instance> get_instance(const char*, const Instance*) override { return Ref<Instance>(); }
  int create_instance(const char*, const Instance*) override { return -1; }
  int delete_instance(const char*, const Instance*) override { return -1; }
  int modify_instance(const char*, const Instance*) override { return -1; }
  int invoke_method(const char*, const Instance*, Instance*) override { return -1; }
  void allow_unload(bool) override {}
  bool get_username(String&) override { return false; }

 private:
  Journal& _journal;
  std::string _name;
};

TEST(Mutex, TryLockAnswers16WhenAnotherThreadHoldsIt) {
  Mutex mutex;
  mutex.lock();
  Thread thread;
  void* answer = nullptr;
  ASSERT_EQ(Thread::create_joinable(
                thread,
                [](void* m) -> void* {
                  return reinterpret_cast<void*>(std::intptr_t{static_cast<Mutex*>(m)->try_lock()});
                },
                &mutex),
            0);
  ASSERT_EQ(Thread::join(thread, answer), 0);
  EXPECT_EQ(reinterpret_cast<std::intptr_t>(answer), 16);
  mutex.unlock();
  EXPECT_EQ(mutex.try_lock(), 0);
  mutex.unlock();
}

TEST(Mutex, TryLockAnswersMinusOneOnAnyOtherFailure) {
  Mutex mutex(false);
  // A robust mutex whose holder ended answers EOWNERDEAD, which is neither success nor EBUSY.
  pthread_mutexattr_t robust;
  pthread_mutexattr_init(&robust);
  pthread_mutexattr_setrobust(&robust, PTHREAD_MUTEX_ROBUST);
  pthread_mutex_destroy(mutex.native());
  ASSERT_EQ(pthread_mutex_init(mutex.native(), &robust), 0);
  pthread_mutexattr_destroy(&robust);
  std::thread([&] { mutex.lock(); }).join();
  EXPECT_EQ(mutex.try_lock(), -1);
  pthread_mutex_consistent(mutex.native());
  mutex.unlock();
}

TEST(Mutex, ARecursiveOneIsLockedAgainByItsHolder) {
  Mutex mutex(true);
  mutex.lock();
  EXPECT_EQ(mutex.try_lock(), 0);
  mutex.lock();
  mutex.unlock();
  mutex.unlock();
  mutex.unlock();
}

TEST(Mutex, APlainOneIsNot) {
  Mutex mutex;
  mutex.lock();
  EXPECT_EQ(mutex.try_lock(), 16);
  mutex.unlock();
}

struct Signalled {
  Mutex mutex;
  Cond arrived;  ///< only the test itself waits for this one
  Cond cond;
  int waiting = 0;
  bool go = false;

  static void* wait(void* arg) {
    auto* s = static_cast<Signalled*>(arg);
    const Auto_Mutex locked(s->mutex);
    ++s->waiting;
    s->arrived.signal();
    while (!s->go) s->cond.wait(s->mutex);
    return arg;
  }
};

TEST(Cond, BroadcastWakesEveryWaiter) {
  Signalled s;
  Thread threads[3];
  for (Thread& t : threads) ASSERT_EQ(Thread::create_joinable(t, Signalled::wait, &s), 0);
  s.mutex.lock();
  while (s.waiting < 3) s.arrived.wait(s.mutex);
  s.go = true;
  s.cond.broadcast();
  s.mutex.unlock();
  for (Thread& t : threads) {
    void* out = nullptr;
    EXPECT_EQ(Thread::join(t, out), 0);
    EXPECT_EQ(out, &s);
  }
}

TEST(Time, SleepsAtLeastAsLongAsTold) {
  const std::uint64_t before = Time::now();
  Time::sleep(2000);
  EXPECT_GE(Time::now() - before, 2000u);
}

TEST(Thread, SelfIsEqualToItselfAlone) {
  Thread other;
  void* out = nullptr;
  ASSERT_EQ(Thread::create_joinable(
                other, [](void*) -> void* { return nullptr; }, nullptr),
            0);
  EXPECT_TRUE(Thread::equal(Thread::self(), Thread::self()));
  EXPECT_FALSE(Thread::equal(Thread::self(), other));
  EXPECT_EQ(Thread::join(other, out), 0);
}

TEST(Thread, DetachedOneRuns) {
  Signalled s;
  Thread thread;
  ASSERT_EQ(Thread::create_detached(
                thread,
                [](void* arg) -> void* {
                  auto* signalled = static_cast<Signalled*>(arg);
                  const Auto_Mutex locked(signalled->mutex);
                  signalled->go = true;
                  signalled->cond.broadcast();
                  return nullptr;
                },
                &s),
            0);
  const Auto_Mutex locked(s.mutex);
  while (!s.go) s.cond.wait(s.mutex);
  EXPECT_TRUE(s.go);
}

TEST(ThreadContext, FormsAStackPerThread) {
  Journal journal;
  {
    Test_Context outer(journal, "outer");
    Test_Context inner(journal, "inner");
    EXPECT_EQ(Thread_Context::top(), nullptr);
    Thread_Context::push(&outer);
    Thread_Context::push(&inner);
    EXPECT_EQ(Thread_Context::top(), &inner);
    Thread_Context::pop();
    EXPECT_EQ(Thread_Context::top(), &outer);
    Thread_Context::pop();
    EXPECT_EQ(Thread_Context::top(), nullptr);
    EXPECT_TRUE(journal.lines.empty());
  }
}

TEST(Thread, FromAThreadWithoutContextRunsWithoutOne) {
  Thread thread;
  void* out = &thread;
  ASSERT_EQ(Thread::create_joinable(
                thread, [](void*) -> void* { return Thread_Context::top(); }, nullptr),
            0);
  ASSERT_EQ(Thread::join(thread, out), 0);
  EXPECT_EQ(out, nullptr);
}

TEST(Thread, InheritsAContextMadeByItsCreators) {
  Journal journal;
  Test_Context context(journal, "context");
  Thread_Context::push(&context);
  Thread thread;
  ASSERT_EQ(Thread::create_joinable(
                thread,
                [](void* arg) -> void* {
                  static_cast<Journal*>(arg)->add("proc");
                  return Thread_Context::top();
                },
                &journal),
            0);
  void* out = nullptr;
  ASSERT_EQ(Thread::join(thread, out), 0);
  EXPECT_NE(out, nullptr);
  EXPECT_NE(out, &context);
  EXPECT_EQ(Thread_Context::top(), &context);
  Thread_Context::pop();
  EXPECT_EQ(journal.lines, (std::vector<std::string>{"context create", "context' start", "proc",
                                                     "context' exit", "context' deleted"}));
}

TEST(Thread, ExitRunsTheExitHook) {
  struct Body {
    static void* run(void* arg) {
      // Static, so that it outlives the thread that leaves it behind.
      static Journal* seen = static_cast<Journal*>(arg);
      static Test_Context context(*seen, "context");
      Thread_Context::push(&context);
      Thread::exit(arg);
    }
  };
  static Journal lasting;
  pthread_t id = {};
  ASSERT_EQ(pthread_create(&id, nullptr, Body::run, &lasting), 0);
  void* out = nullptr;
  ASSERT_EQ(pthread_join(id, &out), 0);
  EXPECT_EQ(out, &lasting);
  EXPECT_EQ(lasting.lines, std::vector<std::string>{"context exit"});
}

TEST(Thread, ThatCannotStartAnswersTheErrorAndDropsTheNewContext) {
  Journal journal;
  Test_Context context(journal, "context");
  Thread_Context::push(&context);
  refuse_threads = true;
  Thread thread;
  const int error = Thread::create_joinable(
      thread, [](void*) -> void* { return nullptr; }, nullptr);
  refuse_threads = false;
  EXPECT_EQ(error, EAGAIN);
  EXPECT_EQ(Thread_Context::top(), &context);
  Thread_Context::pop();
  EXPECT_EQ(journal.lines, (std::vector<std::string>{"context create", "context' deleted"}));
}

TEST(ThreadDeathTest, LeavingAContextBehindFailsAnAssertion) {
  const auto start = [] {
    Thread thread;
    void* out = nullptr;
    Thread::create_joinable(
        thread,
        [](void*) -> void* {
          static Journal journal;
          Thread_Context::push(new Test_Context(journal, "left"));
          return nullptr;
        },
        nullptr);
    Thread::join(thread, out);
  };
  EXPECT_DEATH(start(), "assert: context == Thread_Context::top\\(\\)");
}

TEST(MutexDeathTest, FailingToLockFailsAnAssertion) {
  const auto lock_twice = [] {
    Mutex mutex;
    pthread_mutexattr_t attributes;
    pthread_mutexattr_init(&attributes);
    pthread_mutexattr_settype(&attributes, PTHREAD_MUTEX_ERRORCHECK);
    pthread_mutex_destroy(mutex.native());
    pthread_mutex_init(mutex.native(), &attributes);
    mutex.lock();
    mutex.lock();
  };
  EXPECT_DEATH(lock_twice(), "pthread_mutex_lock\\(&\\(\\(MutexRep\\*\\)_rep\\)->mutex\\) == 0");
}

TEST(Trace, PrintsFileLineAndText) {
  testing::internal::CaptureStderr();
  Thread_Context::__cimrt_trace("file.cpp", 12, "here");
  EXPECT_EQ(testing::internal::GetCapturedStderr(), "TRACE: file.cpp(12): here\n");
}

TEST(AssertDeathTest, PrintsTheConditionAndAborts) {
  EXPECT_EXIT(Thread_Context::__cimrt_assert("file.cpp", 12, "f", "a == b"),
              testing::KilledBySignal(SIGABRT), "file.cpp\\(12\\): f\\(\\): assert: a == b\n\n");
}

}  // namespace
}  // namespace cimrt
