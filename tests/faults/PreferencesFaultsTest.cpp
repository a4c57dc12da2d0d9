// Preferences in a file system that fails, and beside programs that lock nothing.

#include <cerrno>
#include <functional>
#include <string>
#include <system_error>
#include <utility>

#include <gtest/gtest.h>

#include "oxmv/host/PreferencesFile.h"
#include "oxmv/platform/WholeFile.h"
#include "tests/faults/SystemCalls.h"
#include "tests/support/Files.h"
#include "tests/support/TempDir.h"

namespace oxmv::test {
namespace {

Bytes bytesOf(const std::string& text) { return {text.begin(), text.end()}; }

class PreferencesFaults : public testing::Test {
 protected:
  PreferencesFaults() { putFile(file, bytesOf("b = 2\n")); }

  std::error_code setWith(const Fault& fault, std::size_t nth = 1) {
    std::error_code error;
    armFault(nth, fault);
    const bool isDone = updatePreferencesFile(file, {{"a", 1}}, error);
    disarmFault();
    EXPECT_EQ(isDone, !error);
    return error;
  }

  const TempDir folder;
  const std::filesystem::path file = folder / "a.toml";
};

TEST_F(PreferencesFaults, FullDiskLeavesTheFile) {
  EXPECT_EQ(setWith({.kind = Fault::Kind::fail, .error = ENOSPC, .function = "fsync"}),
            std::errc::no_space_on_device);
  EXPECT_EQ(getFile(file), bytesOf("b = 2\n"));
  EXPECT_EQ(namesIn(folder.path()), std::set<std::string>{"a.toml"});
}

TEST_F(PreferencesFaults, FolderThatCannotBeOpenedIsTold) {
  // The first open is of the file, the next of its folder.
  const Fault fault = {.kind = Fault::Kind::fail, .error = EMFILE, .function = "open"};
  std::error_code error;
  for (std::size_t nth = 1; nth <= 2; ++nth) {
    EXPECT_EQ(setWith(fault, nth), std::errc::too_many_files_open) << nth;
    EXPECT_EQ(getFile(file), bytesOf("b = 2\n"));
  }
}

TEST_F(PreferencesFaults, InterruptedLockIsAskedForAgain) {
  EXPECT_FALSE(setWith({.kind = Fault::Kind::fail, .error = EINTR, .function = "flock"}));
  EXPECT_EQ(getFile(file), bytesOf("b = 2\na = 1\n"));
}

TEST_F(PreferencesFaults, FolderWithoutLocksIsDoneWithout) {
  EXPECT_FALSE(setWith({.kind = Fault::Kind::fail, .error = ENOLCK, .function = "flock"}));
  EXPECT_EQ(getFile(file), bytesOf("b = 2\na = 1\n"));
}

// What is looked at first, before there is a lock, may be done or undone by the time there is one.
TEST_F(PreferencesFaults, ChangeBeforeTheLockIsSeen) {
  const auto whileLocking = [](std::function<void()> change) {
    return Fault{.kind = Fault::Kind::meanwhile, .action = std::move(change), .function = "flock"};
  };
  const Bytes done = bytesOf("a = 1 # done\n");
  EXPECT_FALSE(setWith(whileLocking([&] { putFile(file, done); })));
  EXPECT_EQ(getFile(file), done);
  const Bytes noToml = bytesOf("b = = 2\n");
  putFile(file, bytesOf("b = 2\n"));
  EXPECT_EQ(setWith(whileLocking([&] { putFile(file, noToml); })),
            make_error_code(PreferencesError::notToml));
  EXPECT_EQ(getFile(file), noToml);
}

TEST_F(PreferencesFaults, ChangeMeanwhileIsKept) {
  const auto change = [&] { putFile(file, bytesOf("b = 3\n")); };
  EXPECT_FALSE(setWith({.kind = Fault::Kind::meanwhile, .action = change, .function = "fsync"}));
  EXPECT_EQ(getFile(file), bytesOf("b = 3\na = 1\n"));
}

TEST_F(PreferencesFaults, SomebodyWhoNeverStopsIsNotOverwritten) {
  std::string text;
  const auto change = [&] { putFile(file, bytesOf(text += "# again\n")); };
  EXPECT_EQ(setWith({.kind = Fault::Kind::meanwhile,
                     .isLasting = true,
                     .action = change,
                     .function = "fsync"}),
            FileError::changed);
  EXPECT_EQ(getFile(file), bytesOf(text));
  EXPECT_EQ(namesIn(folder.path()), std::set<std::string>{"a.toml"});
}

}  // namespace
}  // namespace oxmv::test
