// Standard error that takes a line in pieces, or late, or not at all.

#include <cerrno>
#include <csignal>
#include <string>

#include <gtest/gtest.h>
#include <unistd.h>

#include "oxmv/host/StandardError.h"
#include "tests/faults/SystemCalls.h"
#include "tests/support/ChildProcess.h"

namespace oxmv::test {
namespace {

// What arrives of a line. While a fault is armed no more than three bytes are taken at once.
std::string arrivesWith(const Fault& fault, std::size_t nth) {
  int ends[2] = {};
  EXPECT_EQ(::pipe(ends), 0);
  const pid_t child = startChild([&] {
    const int before = ::dup(STDERR_FILENO);
    ::dup2(ends[1], STDERR_FILENO);
    armFault(nth, fault);
    writeToStandardError("a line");
    disarmFault();
    ::dup2(before, STDERR_FILENO);
    return faultyFunction().empty() ? 1 : 0;
  });
  ::close(ends[1]);
  EXPECT_EQ(exitStatusOf(child), 0);
  char buffer[32];
  const ssize_t size = ::read(ends[0], buffer, sizeof buffer);
  ::close(ends[0]);
  return {buffer, static_cast<std::size_t>(size < 0 ? 0 : size)};
}

TEST(StandardErrorFaults, InterruptedLineGoesOn) {
  for (std::size_t nth = 1; nth <= 3; ++nth)
    EXPECT_EQ(arrivesWith({.kind = Fault::Kind::fail, .error = EINTR, .function = "write"}, nth),
              "a line\n");
}

TEST(StandardErrorFaults, LineEndsWhereWritingFails) {
  EXPECT_EQ(arrivesWith({.kind = Fault::Kind::fail, .error = EIO, .function = "write"}, 2), "a l");
}

// The signal that tells of a pipe without a reader is the application's if it was there before.
TEST(StandardErrorFaults, LeavesASignalThatWasPending) {
  EXPECT_TRUE(inChildProcess([] {
    sigset_t signals;
    sigemptyset(&signals);
    sigaddset(&signals, SIGPIPE);
    ::sigprocmask(SIG_BLOCK, &signals, nullptr);
    ::raise(SIGPIPE);
    int ends[2] = {};
    if (::pipe(ends) != 0) return false;
    ::dup2(ends[1], STDERR_FILENO);
    ::close(ends[0]);
    writeToStandardError("nobody");
    sigset_t pending;
    ::sigpending(&pending);
    return sigismember(&pending, SIGPIPE) == 1;
  }));
}

}  // namespace
}  // namespace oxmv::test
