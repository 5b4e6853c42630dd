#include <fcntl.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <semaphore.h>
#include <sys/stat.h>
#include <unistd.h>

#include <chrono>
#include <future>
#include <memory>
#include <string>
#include <thread>

#include "access/TVX_MethodWrapper.h"
#include "support/Fake_Libraries.h"
#include "support/Log_Capture.h"

namespace cimrt {
namespace {

using testing::ElementsAre;
using tvx::test::Fake_Libraries;
using tvx::test::Log_Capture;

const std::string PID = std::to_string(::getpid());
const std::string INIT = "/TVX_RM_INIT_LIB_" + PID;
const std::string DONE = "/TVX_RM_INIT_LIB_DONE_" + PID;

std::string sharedFile(const std::string& name) {
  return "/dev/shm/sem." + name.substr(1);
}

bool exists(const std::string& name) {
  return ::access(sharedFile(name).c_str(), F_OK) == 0;
}

int valueOf(const std::string& name) {
  sem_t* const semaphore = ::sem_open(name.c_str(), 0);
  if (semaphore == SEM_FAILED) return -1;
  int value = -1;
  ::sem_getvalue(semaphore, &value);
  ::sem_close(semaphore);
  return value;
}

class Wrapper_Life : public testing::Test {
 protected:
  void SetUp() override {
    libraries.provide(LRM_InitLib, [this] {
      ++calls;
      return result;
    });
    libraries.load();
  }
  void TearDown() override {
    ::sem_unlink(INIT.c_str());
    ::sem_unlink(DONE.c_str());
  }

  Fake_Libraries libraries;
  Log_Capture capture;
  std::atomic<int> calls{0};
  int result = 0;
};

TEST_F(Wrapper_Life, TheFirstComerInitialisesTheLibrary) {
  {
    const TVX_MethodWrapper wrapper;
    EXPECT_EQ(calls, 1);
    EXPECT_EQ(valueOf(INIT), 2);
    EXPECT_EQ(valueOf(DONE), 0);  // opened, never posted
    struct stat info {};
    ASSERT_EQ(::stat(sharedFile(INIT).c_str(), &info), 0);
    EXPECT_EQ(info.st_mode & 0777, 0644U);
  }
  EXPECT_FALSE(exists(INIT));
  EXPECT_TRUE(exists(DONE));  // neither closed nor unlinked
  EXPECT_THAT(capture.texts(),
              ElementsAre("TVX_MethodWrapper::Constructor", "Setting Up for FIFO.. ",
                          "Aquired Semaphore.. Running RM_InitLib " + INIT + " ",
                          "Aquired Completed Semaphore.. Running RM_InitLib " + DONE,
                          "Signalling Completed Semaphore.. Running RM_InitLib",
                          "Signaled Completed Semaphore.. Running RM_InitLib",
                          "RM Library initialized", "TVX_MethodWrapper::Destructor",
                          "Value of Sem in destructor=3", "RM Library uninitialzed"));
  for (const auto& line : capture.lines()) EXPECT_EQ(line.level, TVX_DBG) << line.text;
}

TEST_F(Wrapper_Life, ALaterConstructionInitialisesAgain) {
  const TVX_MethodWrapper first;
  { const TVX_MethodWrapper second; }
  EXPECT_EQ(calls, 2);
}

TEST_F(Wrapper_Life, CanBeBuiltAgainAfterItsEnd) {
  for (int round = 1; round <= 3; ++round) {
    const TVX_MethodWrapper wrapper;
    EXPECT_EQ(calls, round);
    EXPECT_EQ(valueOf(INIT), 2);
  }
}

TEST_F(Wrapper_Life, ANegativeResultIsNoFailure) {
  result = -1;
  EXPECT_NO_THROW(TVX_MethodWrapper{});
}

TEST_F(Wrapper_Life, ARefusalThrowsAndLeavesNoSemaphore) {
  result = 64;
  EXPECT_THROW(TVX_MethodWrapper{}, std::exception);
  EXPECT_TRUE(
      capture.has(TVX_CRIT, "Error : Initialization of RMLib:: RM_InitLib failed with[64]"));
  EXPECT_EQ(capture.count(TVX_DBG, "RM Library initialized"), 0U);
  EXPECT_FALSE(exists(INIT));
  result = 0;
  EXPECT_NO_THROW(TVX_MethodWrapper{});
}

TEST_F(Wrapper_Life, WithoutALibraryTheConstructionFails) {
  libraries.remove("LRM_InitLib");
  UnloadRuntimeLibraries();
  LoadRuntimeLibraries();
  EXPECT_THROW(TVX_MethodWrapper{}, std::exception);
  EXPECT_TRUE(capture.has(TVX_CRIT, "Error : Initialization of RMLib:: RM_InitLib failed with[1]"));
}

TEST_F(Wrapper_Life, ALeftoverOfADeadProcessBlocksNobody) {
  sem_t* const leftover = ::sem_open(INIT.c_str(), O_CREAT, 0644, 0);
  ASSERT_NE(leftover, SEM_FAILED);
  ::sem_close(leftover);
  const TVX_MethodWrapper wrapper;
  EXPECT_EQ(calls, 1);
  EXPECT_EQ(valueOf(INIT), 2);
}

TEST_F(Wrapper_Life, WithoutASemaphoreTheLibraryStaysUninitialisedSilently) {
  ASSERT_EQ(::mkdir(sharedFile(INIT).c_str(), 0700), 0);  // cannot be opened as a semaphore
  { const TVX_MethodWrapper wrapper; }
  EXPECT_EQ(calls, 0);
  EXPECT_THAT(capture.texts(),
              ElementsAre("TVX_MethodWrapper::Constructor", "Setting Up for FIFO.. ",
                          "RM Library initialized", "TVX_MethodWrapper::Destructor",
                          "RM Library uninitialzed"));
  ASSERT_EQ(::rmdir(sharedFile(INIT).c_str()), 0);
}

TEST_F(Wrapper_Life, ASecondComerWaitsForTheFirst) {
  std::promise<void> entered;
  std::promise<void> released;
  libraries.provide(LRM_InitLib, [&] {
    ++calls;
    entered.set_value();
    released.get_future().wait();
    return 0;
  });
  std::unique_ptr<TVX_MethodWrapper> first;
  std::unique_ptr<TVX_MethodWrapper> second;
  std::thread a([&] { first = std::make_unique<TVX_MethodWrapper>(); });
  entered.get_future().wait();
  std::thread b([&] { second = std::make_unique<TVX_MethodWrapper>(); });
  const auto waits = [&] {
    for (const std::string& text : capture.texts()) {
      if (text.starts_with("Waiting on Completed Semaphore.. To issue RM Calls.." + INIT +
                           ".. sem = 0x")) {
        return true;
      }
    }
    return false;
  };
  while (!waits()) std::this_thread::yield();
  EXPECT_FALSE(capture.has(TVX_DBG, "Recieved signal on Completed Semaphore.. To issue RM Calls"));
  released.set_value();
  a.join();
  b.join();
  EXPECT_TRUE(capture.has(TVX_DBG, "Recieved signal on Completed Semaphore.. To issue RM Calls"));
  EXPECT_EQ(calls, 1);
}

}  // namespace
}  // namespace cimrt
