// Runs a piece of a test in a process of its own, which it may harm.
#pragma once

#include <gtest/gtest.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <csignal>
#include <cstdio>
#include <cstdlib>

namespace tvx::test {

/// The exit code of a forked process that ran `body()` and then left as a server does, by `exit`; a
/// failed expectation in it counts as 1 and is told on its stderr. -1 if a signal ended it. The
/// calling process must have no other threads.
template <class Body>
int inChild(Body&& body) {
  const auto failures = [] {
    const testing::TestResult& result =
        *testing::UnitTest::GetInstance()->current_test_info()->result();
    int count = 0;
    for (int i = 0; i < result.total_part_count(); ++i)
      count += result.GetTestPartResult(i).failed() ? 1 : 0;
    return count;
  };
  const int before = failures();
  std::fflush(nullptr);
  const pid_t child = fork();
  if (child == 0) {
    alarm(60);  // a child that hangs ends, and is seen as ended by a signal
    body();
    std::exit(failures() > before ? 1 : 0);
  }
  int status = 0;
  if (child < 0 || waitpid(child, &status, 0) != child || !WIFEXITED(status)) return -1;
  return WEXITSTATUS(status);
}

}  // namespace tvx::test
