// Code that must not be run in the process of the tests itself.

#pragma once

#include <gtest/gtest.h>
#include <sys/wait.h>
#include <unistd.h>

// Where the reach of the tests is counted: keeps the counts of a process that ends at once.
extern "C" [[gnu::weak]] void __gcov_dump();

namespace oxmv::test {

// The exit status of a child that was left by an exception.
constexpr int thrownStatus = 99;

// Starts a process that runs `body`, exits with the status that it answers, and leaves nothing of
// this process behind. Expectations in it are not heard of.
template <class Body>
pid_t startChild(Body body) {
  const pid_t child = ::fork();
  EXPECT_GE(child, 0);
  if (child != 0) return child;
  int status = thrownStatus;
  try {
    status = body();
  } catch (...) {
  }
  if (__gcov_dump != nullptr) __gcov_dump();
  ::_exit(status);
}

// Waits for its end; answers its exit status, -1 if it was killed.
inline int exitStatusOf(pid_t child) {
  int status = 1;
  if (child <= 0 || ::waitpid(child, &status, 0) != child || !WIFEXITED(status)) return -1;
  return WEXITSTATUS(status);
}

// Runs `body` likewise; answers whether it returned true.
template <class Body>
bool inChildProcess(Body body) {
  return exitStatusOf(startChild([&] { return body() ? 0 : 1; })) == 0;
}

// The same as a user who may not do everything.
template <class Body>
bool asOrdinaryUser(Body body) {
  return inChildProcess([&] {
    if (::geteuid() != 0) return body();
    const gid_t group = ::getegid();
    const bool isGood = ::setegid(65534) == 0 && ::seteuid(65534) == 0 && body();
    // Back to who may write where the reach of the tests is counted.
    return ::seteuid(0) == 0 && ::setegid(group) == 0 && isGood;
  });
}

}  // namespace oxmv::test
