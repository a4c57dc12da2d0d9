// Code that must not be run in the process of the tests itself.

#pragma once

#include <gtest/gtest.h>
#include <sys/wait.h>
#include <unistd.h>

namespace oxmv::test {

// Runs `body` in a process of its own, which nothing of it outlives; answers whether it returned
// true. Expectations in it are not heard of.
template <class Body>
bool inChildProcess(Body body) {
  const pid_t child = ::fork();
  if (child == 0) ::_exit(body() ? 0 : 1);
  int status = 1;
  EXPECT_EQ(::waitpid(child, &status, 0), child);
  return WIFEXITED(status) && WEXITSTATUS(status) == 0;
}

// The same as a user who may not do everything.
template <class Body>
bool asOrdinaryUser(Body body) {
  return inChildProcess([&] {
    const bool isOrdinary = ::geteuid() != 0 || (::setegid(65534) == 0 && ::seteuid(65534) == 0);
    return isOrdinary && body();
  });
}

}  // namespace oxmv::test
