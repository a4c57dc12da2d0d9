// The command when there is no memory.

#include <filesystem>
#include <new>
#include <set>
#include <string>
#include <vector>

#include <fcntl.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include "cli/Run.h"
#include "tests/memory/Allocations.h"
#include "tests/support/ChildProcess.h"
#include "tests/support/Files.h"
#include "tests/support/TempDir.h"

namespace oxmv::test {
namespace {

namespace fs = std::filesystem;

constexpr int failed = 3;  // an input or output
constexpr int bug = 70;
const std::string noMemory = "oxmv: error: not enough memory (no-memory)\n";

std::string textOf(const Bytes& bytes) { return {bytes.begin(), bytes.end()}; }

class CommandNoMemory : public testing::Test {
 protected:
  struct Ending {
    int exitCode = -1;
    bool wasFelt = false;
    std::string out;
    std::string err;
  };

  // Runs the command in a process of its own, in which `prepare` comes first.
  template <class Prepare>
  Ending run(const std::vector<std::string>& words, Prepare prepare) {
    const fs::path out = folder_ / "out", err = folder_ / "err", felt = folder_ / "felt";
    putFile(felt, {});
    const pid_t child = startChild([&] {
      std::vector<const char*> argv = {"oxmv"};
      for (const std::string& word : words) argv.push_back(word.c_str());
      for (const char* name : {"HOME", "XDG_CONFIG_HOME", "XDG_CONFIG_DIRS"})
        ::setenv(name, "/dev/null/nowhere", 1);
      ::setenv("OXMV_LOOKS", folder_.path().c_str(), 1);
      constexpr int anew = O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC;
      ::dup2(::open("/dev/null", O_RDONLY | O_CLOEXEC), STDIN_FILENO);
      ::dup2(::open(out.c_str(), anew, 0600), STDOUT_FILENO);
      ::dup2(::open(err.c_str(), anew, 0600), STDERR_FILENO);
      prepare();
      const int status = cli::run(argv);
      if (disarmShortage()) putFile(felt, bytesOf("yes"));
      return status;
    });
    const int exitCode = exitStatusOf(child);
    return {exitCode, !getFile(felt).empty(), textOf(getFile(out)), textOf(getFile(err))};
  }

  // With an allocation failing; the later ones only now and then, for there are thousands. Whatever
  // fails is told in words about memory. `check` gets whether the command did its work.
  template <class Check>
  void failAllocations(const std::vector<std::string>& words, Check check) {
    const Ending good = run(words, [] { armShortage(1'000'000'000, Shortage::once); });
    ASSERT_EQ(good.exitCode, 0) << good.err;
    check(true);
    for (const Shortage shortage : {Shortage::once, Shortage::lasting}) {
#ifdef OXMV_ALLOCATES_BY_SANITIZER
      if (shortage == Shortage::once) continue;
#endif
      std::size_t failures = 0;
      bool wasFelt = true;
      for (std::size_t nth = 1; wasFelt && !HasFailure(); nth += 1 + nth / 16) {
        SCOPED_TRACE(testing::Message() << words.front() << ", allocation " << nth);
        const Ending ending = run(words, [&] { armShortage(nth, shortage); });
        wasFelt = ending.wasFelt;
        if (ending.exitCode == 0) {
          EXPECT_EQ(ending.out, good.out);
          EXPECT_EQ(ending.err, good.err);
        } else {
          ++failures;
          EXPECT_EQ(ending.exitCode, failed) << ending.err;
          const bool isTold = ending.err == noMemory ||
                              ending.err.find("Cannot allocate memory") != ending.err.npos;
          EXPECT_TRUE(isTold) << ending.err;
        }
        check(ending.exitCode == 0);
      }
      EXPECT_GT(failures, 0u);
    }
  }

  std::string example(const std::string& name) const { return OXMV_SOURCE_DIR "/examples/" + name; }

  TempDir folder_;
};

TEST_F(CommandNoMemory, ReadingShowsAllOrSaysSo) {
  const auto nothing = [](bool) {};
  failAllocations({"show", example("typical-clip.colr")}, nothing);
  failAllocations({"show", "--json", example("typical-clip.colr")}, nothing);
  failAllocations({"dump", example("walk.colr")}, nothing);
  failAllocations({"get", example("walk.colr"), "REEL"}, nothing);
  failAllocations({"diff", example("walk.colr"), example("walk.colr")}, nothing);
  failAllocations({"check", example("walk.colr")}, nothing);
  failAllocations({"help", "set"}, nothing);
  failAllocations({"still", example("still.jpg")}, nothing);
}

TEST_F(CommandNoMemory, EditLeavesTheOldClipOrTheNew) {
  const fs::path clip = folder_ / "clip.colr";
  const Bytes before = getFile(example("walk.colr"));
  putFile(clip, before);
  Bytes after;
  failAllocations({"set", clip.string(), "REEL=B002"}, [&](bool isDone) {
    const Bytes now = getFile(clip);
    if (after.empty()) after = now;
    EXPECT_EQ(now, isDone ? after : before);
    EXPECT_EQ(namesIn(folder_.path()), (std::set<std::string>{"clip.colr", "out", "err", "felt"}));
    putFile(clip, before);
  });
  EXPECT_NE(before, after);
}

// An exception that nobody expects: thrown where memory is asked for, in place of the usual one.
TEST_F(CommandNoMemory, UnexpectedExceptionIsABugWithoutItsName) {
  for (const std::size_t nth : {1u, 20u, 100u}) {
    const Ending ending = run({"show", example("typical-clip.colr")}, [&] {
      std::set_new_handler([] { throw 1; });
      armShortage(nth, Shortage::lasting);
    });
    EXPECT_EQ(ending.exitCode, bug);
    EXPECT_EQ(ending.err,
              "oxmv: error: a bug in oxmv; please report what you called it with (bug)\n");
  }
}

}  // namespace
}  // namespace oxmv::test
