#include <algorithm>
#include <array>
#include <csignal>
#include <string>
#include <thread>
#include <vector>

#include <fcntl.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include "oxmv/host/StandardError.h"
#include "tests/support/ChildProcess.h"

namespace oxmv {
namespace {

// Both ends of a pipe.
struct Pipe {
  Pipe() { EXPECT_EQ(::pipe(ends.data()), 0); }
  ~Pipe() {
    closeReader();
    closeWriter();
  }
  void closeReader() { close(ends[0]); }
  void closeWriter() { close(ends[1]); }
  std::string readAll() {
    closeWriter();
    std::string all;
    std::array<char, 4096> some = {};
    for (ssize_t count = 1; count > 0;) {
      count = ::read(ends[0], some.data(), some.size());
      if (count > 0) all.append(some.data(), static_cast<std::size_t>(count));
    }
    return all;
  }
  static void close(int& end) {
    if (end >= 0) ::close(end);
    end = -1;
  }

  std::array<int, 2> ends = {-1, -1};
};

// What `work` writes to standard error; less than a pipe holds.
template <class Work>
std::string standardErrorOf(Work work) {
  Pipe pipe;
  const int before = ::dup(STDERR_FILENO);
  ::dup2(pipe.ends[1], STDERR_FILENO);
  work();
  ::dup2(before, STDERR_FILENO);
  ::close(before);
  return pipe.readAll();
}

TEST(StandardError, GetsALine) {
  EXPECT_EQ(standardErrorOf([] { writeToStandardError("Error : é"); }), "Error : é\n");
  EXPECT_EQ(standardErrorOf([] { writeToStandardError(""); }), "\n");
}

TEST(StandardError, GetsNoControlCharacters) {
  EXPECT_EQ(standardErrorOf([] {
              writeToStandardError(std::string_view("LUT (a\n\x1B[2J\0\xFF\xE2\x80\xAE.xml)", 20));
            }),
            "LUT (a\\x0A\\x1B[2J\\x00\\xFF\\u{202E}.xml\n");
}

TEST(StandardError, GetsWholeLinesFromThreadsAtOnce) {
  constexpr int lines = 100;
  const std::string text = standardErrorOf([] {
    std::vector<std::thread> threads;
    for (char name = 'a'; name < 'e'; ++name) {
      threads.emplace_back([name] {
        for (int i = 0; i < lines; ++i) writeToStandardError(std::string(99, name));
      });
    }
    for (auto& thread : threads) thread.join();
  });
  ASSERT_EQ(text.size(), 4 * lines * 100u);
  for (std::size_t i = 0; i < text.size(); i += 100)
    EXPECT_EQ(text.substr(i, 100), std::string(99, text[i]) + '\n');
}

TEST(StandardError, IsLeftAloneWhenItIsClosed) {
  EXPECT_TRUE(test::inChildProcess([] {
    ::close(STDERR_FILENO);
    writeToStandardError("nobody");
    return true;
  }));
}

TEST(StandardError, EndsNoProcessWhenNobodyReads) {
  EXPECT_TRUE(test::inChildProcess([] {
    std::signal(SIGPIPE, SIG_DFL);
    Pipe pipe;
    ::dup2(pipe.ends[1], STDERR_FILENO);
    pipe.closeReader();
    writeToStandardError("nobody");
    sigset_t pending;
    sigset_t blocked;
    ::sigpending(&pending);
    ::sigprocmask(SIG_BLOCK, nullptr, &blocked);
    return sigismember(&pending, SIGPIPE) == 0 && sigismember(&blocked, SIGPIPE) == 0;
  }));
}

TEST(StandardError, DoesNotWaitForAFullPipeThatIsNotToBeWaitedFor) {
  EXPECT_TRUE(test::inChildProcess([] {
    Pipe pipe;
    ::fcntl(pipe.ends[1], F_SETFL, O_NONBLOCK);
    ::dup2(pipe.ends[1], STDERR_FILENO);
    for (int i = 0; i < 100; ++i) writeToStandardError(std::string(4000, 'x'));
    return true;
  }));
}

}  // namespace
}  // namespace oxmv
