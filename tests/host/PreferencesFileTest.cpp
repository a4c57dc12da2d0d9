#include <chrono>
#include <csignal>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <optional>
#include <string>
#include <vector>

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include "oxmv/host/PreferencesFile.h"
#include "oxmv/platform/WholeFile.h"
#include "tests/support/ChildProcess.h"
#include "tests/support/EnvironmentVariable.h"
#include "tests/support/Printing.h"
#include "tests/support/TempDir.h"

namespace oxmv {
namespace {

namespace fs = std::filesystem;
using test::EnvironmentVariable;
using test::TempDir;
using Paths = std::vector<fs::path>;
using State = PreferencesFile::State;

void put(const fs::path& path, const std::string& text) {
  std::ofstream(path, std::ios::binary) << text;
}

std::string get(const fs::path& path) {
  std::ifstream file(path, std::ios::binary);
  return {std::istreambuf_iterator<char>(file), {}};
}

std::ptrdiff_t filesIn(const fs::path& folder) {
  return std::distance(fs::directory_iterator(folder), {});
}

// Empty when the update succeeds.
std::error_code update(const fs::path& path, const PreferencesChanges& changes) {
  std::error_code error = std::make_error_code(std::errc::io_error);
  const bool isDone = updatePreferencesFile(path, changes, error);
  EXPECT_EQ(isDone, !error);
  return error;
}

TEST(UserPreferencesPath, LiesInTheFolderForConfiguration) {
  const EnvironmentVariable config("XDG_CONFIG_HOME", "/config");
  const EnvironmentVariable home("HOME", "/home/me");
  EXPECT_EQ(userPreferencesPath("com.ombrix.oxmv"), "/config/com.ombrix.oxmv.toml");
}

TEST(UserPreferencesPath, LiesInTheHomeWhereNoSuchFolderIsNamed) {
  const EnvironmentVariable home("HOME", "/home/me");
  for (const auto& value : {std::optional<std::string>(), std::optional<std::string>(""),
                            std::optional<std::string>("config")}) {
    const EnvironmentVariable config("XDG_CONFIG_HOME", value);
    EXPECT_EQ(userPreferencesPath("a"), "/home/me/.config/a.toml");
  }
}

TEST(UserPreferencesPath, IsNowhereWithoutAHome) {
  const EnvironmentVariable config("XDG_CONFIG_HOME", std::nullopt);
  for (const auto& value : {std::optional<std::string>(), std::optional<std::string>(""),
                            std::optional<std::string>("me")}) {
    const EnvironmentVariable home("HOME", value);
    EXPECT_EQ(userPreferencesPath("a"), std::nullopt);
  }
}

TEST(PreferencesPaths, AreNoneForAnIdentifierThatIsNoFileName) {
  const EnvironmentVariable config("XDG_CONFIG_HOME", "/config");
  for (const std::string& identifier :
       {std::string(), std::string("../a"), std::string("a\0b", 3)}) {
    EXPECT_EQ(userPreferencesPath(identifier), std::nullopt);
    EXPECT_EQ(systemPreferencesPaths(identifier), Paths());
  }
}

TEST(SystemPreferencesPaths, LieInEachFolderInOrder) {
  const EnvironmentVariable folders("XDG_CONFIG_DIRS", "/b:relative:/a::/c/");
  EXPECT_EQ(systemPreferencesPaths("x"), (Paths{"/b/x.toml", "/a/x.toml", "/c/x.toml"}));
}

TEST(SystemPreferencesPaths, LieInTheUsualFolderWhenNoneIsNamed) {
  for (const auto& value : {std::optional<std::string>(), std::optional<std::string>("")}) {
    const EnvironmentVariable folders("XDG_CONFIG_DIRS", value);
    EXPECT_EQ(systemPreferencesPaths("x"), Paths{"/etc/xdg/x.toml"});
  }
}

TEST(ReadPreferencesFile, GivesTheValues) {
  const TempDir dir;
  put(dir / "a.toml", "LUTsPath = '/looks'\n[t]\n");
  const PreferencesFile file = readPreferencesFile(dir / "a.toml");
  EXPECT_EQ(file.path, dir / "a.toml");
  EXPECT_EQ(file.state, State::good);
  EXPECT_EQ(file.values, (Dictionary{{"LUTsPath", "/looks"}, {"t", Dictionary()}}));
}

TEST(ReadPreferencesFile, SaysThatThereIsNone) {
  const TempDir dir;
  put(dir / "a.toml", "");
  EXPECT_EQ(readPreferencesFile(dir / "b.toml").state, State::absent);
  EXPECT_EQ(readPreferencesFile(dir / "a.toml/b.toml").state, State::absent);
}

TEST(ReadPreferencesFile, SaysWhyItCannotBeRead) {
  const TempDir dir;
  fs::create_directory(dir / "folder");
  EXPECT_EQ(readPreferencesFile(dir / "folder").state, State::unreadable);
  EXPECT_EQ(readPreferencesFile(dir / "folder").error, std::errc::is_a_directory);

  ASSERT_EQ(::mkfifo((dir / "pipe").c_str(), 0600), 0);
  EXPECT_EQ(readPreferencesFile(dir / "pipe").error, FileError::notRegular);

  put(dir / "large", std::string(maxPreferencesFileSize, '\n'));
  EXPECT_EQ(readPreferencesFile(dir / "large").state, State::good);
  put(dir / "large", std::string(maxPreferencesFileSize + 1, '\n'));
  EXPECT_EQ(readPreferencesFile(dir / "large").error, PreferencesError::tooLarge);
}

TEST(ReadPreferencesFile, SaysWhereItIsNotToml) {
  const TempDir dir;
  put(dir / "a.toml", "a = 1\nb\n");
  const PreferencesFile file = readPreferencesFile(dir / "a.toml");
  EXPECT_EQ(file.state, State::notToml);
  EXPECT_EQ(file.problem.line, 2u);
  EXPECT_NE(file.problem.message, "");
  EXPECT_EQ(file.values, Dictionary());
}

TEST(PreferencesError, SaysWhatIsWrong) {
  const auto message = [](PreferencesError error) { return make_error_code(error).message(); };
  EXPECT_EQ(message(PreferencesError::noPlace), "There is no folder for preferences");
  EXPECT_EQ(message(PreferencesError::notToml), "The preferences file cannot be read as TOML");
  EXPECT_EQ(message(PreferencesError::tooLarge), "The preferences file is larger than 256 KiB");
  EXPECT_EQ(message(PreferencesError::noForm), "The value cannot be kept in a preferences file");
  EXPECT_EQ(message(PreferencesError::busy), "Another program keeps the preferences folder locked");
}

TEST(UpdatePreferencesFile, ChangesWhatIsAskedForAndNothingElse) {
  const TempDir dir;
  put(dir / "a.toml", "# mine\na = 1 # one\nb = 2\nunknown = 1979-05-27\n");
  ASSERT_EQ(::chmod((dir / "a.toml").c_str(), 0640), 0);
  EXPECT_FALSE(update(dir / "a.toml", {{"a", "x"}, {"b", {}}, {"c", 3}}));
  EXPECT_EQ(get(dir / "a.toml"), "# mine\na = \"x\" # one\nunknown = 1979-05-27\nc = 3\n");
  EXPECT_EQ(fs::status(dir / "a.toml").permissions(), fs::perms(0640));
  EXPECT_EQ(filesIn(dir.path()), 1);
}

TEST(UpdatePreferencesFile, MakesTheFileAndItsFolderForTheUserAlone) {
  const TempDir dir;
  EXPECT_FALSE(update(dir / "config/a.toml", {{"a", 1}}));
  EXPECT_EQ(get(dir / "config/a.toml"), "a = 1\n");
  EXPECT_EQ(fs::status(dir / "config").permissions(), fs::perms::owner_all);
}

TEST(UpdatePreferencesFile, MakesNoFoldersAboveIt) {
  const TempDir dir;
  EXPECT_EQ(update(dir / "above/config/a.toml", {{"a", 1}}), std::errc::no_such_file_or_directory);
  EXPECT_EQ(filesIn(dir.path()), 0);
}

TEST(UpdatePreferencesFile, TouchesNothingWhenNothingChanges) {
  const TempDir dir;
  EXPECT_FALSE(update(dir / "config/a.toml", {}));
  EXPECT_FALSE(update(dir / "config/a.toml", {{"a", {}}}));
  EXPECT_EQ(filesIn(dir.path()), 0);

  put(dir / "a.toml", "a = 'x'");
  struct stat before = {};
  ASSERT_EQ(::stat((dir / "a.toml").c_str(), &before), 0);
  EXPECT_FALSE(update(dir / "a.toml", {{"a", "x"}, {"b", {}}}));
  struct stat after = {};
  ASSERT_EQ(::stat((dir / "a.toml").c_str(), &after), 0);
  EXPECT_EQ(before.st_ino, after.st_ino);
  EXPECT_EQ(get(dir / "a.toml"), "a = 'x'");
}

TEST(UpdatePreferencesFile, LeavesAFileThatIsNotToml) {
  const TempDir dir;
  put(dir / "a.toml", "a = 1\nb\n");
  EXPECT_EQ(update(dir / "a.toml", {{"a", 2}}), PreferencesError::notToml);
  EXPECT_EQ(get(dir / "a.toml"), "a = 1\nb\n");
}

TEST(UpdatePreferencesFile, LeavesAFileThatIsTooLarge) {
  const TempDir dir;
  const std::string text(maxPreferencesFileSize + 1, '\n');
  put(dir / "a.toml", text);
  EXPECT_EQ(update(dir / "a.toml", {{"a", 2}}), PreferencesError::tooLarge);
  EXPECT_EQ(get(dir / "a.toml"), text);
}

TEST(UpdatePreferencesFile, MakesNoFileTooLarge) {
  const TempDir dir;
  const std::string text(maxPreferencesFileSize - 1, '\n');
  put(dir / "a.toml", text);
  EXPECT_EQ(update(dir / "a.toml", {{"a", 2}}), PreferencesError::tooLarge);
  EXPECT_EQ(get(dir / "a.toml"), text);
}

TEST(UpdatePreferencesFile, MakesAllChangesOrNone) {
  const TempDir dir;
  put(dir / "a.toml", "a = 1\n");
  EXPECT_EQ(update(dir / "a.toml", {{"a", 2}, {"b", Value::data({})}}), PreferencesError::noForm);
  EXPECT_EQ(get(dir / "a.toml"), "a = 1\n");
}

TEST(UpdatePreferencesFile, LeavesAFileThatMayNotBeReadOrReplaced) {
  const TempDir dir;
  put(dir / "a.toml", "a = 1\n");
  put(dir / "secret.toml", "a = 1\n");
  fs::permissions(dir / "secret.toml", fs::perms::none);
  fs::permissions(dir.path(), fs::perms(0555));
  EXPECT_TRUE(test::asOrdinaryUser([&] {
    return update(dir / "a.toml", {{"a", 2}}) == std::errc::permission_denied &&
           update(dir / "secret.toml", {{"a", 2}}) == std::errc::permission_denied &&
           !update(dir / "a.toml", {{"a", 1}});  // nothing to write
  }));
  fs::permissions(dir.path(), fs::perms(0755));
  fs::permissions(dir / "secret.toml", fs::perms(0600));
  EXPECT_EQ(get(dir / "a.toml"), "a = 1\n");
  EXPECT_EQ(get(dir / "secret.toml"), "a = 1\n");
}

TEST(UpdatePreferencesFile, WritesInAFolderThatMayNotBeRead) {
  const TempDir dir;
  fs::permissions(dir.path(), fs::perms(0733));
  EXPECT_TRUE(test::asOrdinaryUser([&] { return !update(dir / "a.toml", {{"a", 2}}); }));
  EXPECT_EQ(get(dir / "a.toml"), "a = 2\n");
}

TEST(UpdatePreferencesFile, FollowsASymbolicLink) {
  const TempDir dir;
  fs::create_directory(dir / "dotfiles");
  put(dir / "dotfiles/mine.toml", "a = 1\n");
  fs::create_symlink("dotfiles/mine.toml", dir / "a.toml");
  EXPECT_FALSE(update(dir / "a.toml", {{"a", 2}}));
  EXPECT_TRUE(fs::is_symlink(dir / "a.toml"));
  EXPECT_EQ(get(dir / "dotfiles/mine.toml"), "a = 2\n");
}

TEST(UpdatePreferencesFile, GivesUpOnAFolderThatStaysLocked) {
  const TempDir dir;
  const int folder = ::open(dir.path().c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
  ASSERT_EQ(::flock(folder, LOCK_EX), 0);
  std::error_code error;
  EXPECT_FALSE(
      updatePreferencesFile(dir / "a.toml", {{"a", 1}}, error, std::chrono::milliseconds(20)));
  EXPECT_EQ(error, PreferencesError::busy);
  EXPECT_EQ(filesIn(dir.path()), 0);
  ::close(folder);
  EXPECT_FALSE(update(dir / "a.toml", {{"a", 1}}));
}

TEST(UpdatePreferencesFile, WaitsForALockThatGoesWithItsProgram) {
  const TempDir dir;
  int ready[2];
  ASSERT_EQ(::pipe(ready), 0);
  const pid_t child = ::fork();
  if (child == 0) {
    const int folder = ::open(dir.path().c_str(), O_RDONLY | O_DIRECTORY);
    ::flock(folder, LOCK_EX);
    [[maybe_unused]] const auto written = ::write(ready[1], "x", 1);
    ::pause();  // until it is killed
  }
  char byte = 0;
  ASSERT_EQ(::read(ready[0], &byte, 1), 1);
  std::error_code error;
  EXPECT_FALSE(
      updatePreferencesFile(dir / "a.toml", {{"a", 1}}, error, std::chrono::milliseconds(0)));
  EXPECT_EQ(error, PreferencesError::busy);
  ASSERT_EQ(::kill(child, SIGKILL), 0);
  EXPECT_FALSE(update(dir / "a.toml", {{"a", 1}}));
  ASSERT_EQ(::waitpid(child, nullptr, 0), child);
  ::close(ready[0]);
  ::close(ready[1]);
}

// Each process counts a key of its own up; what the others do must never be lost.
TEST(UpdatePreferencesFile, LosesNothingOfProcessesThatWriteAtOnce) {
  constexpr int rounds = 50;
  const TempDir dir;
  put(dir / "a.toml", "# kept\n");
  std::vector<pid_t> children;
  for (const char* key : {"a", "b", "c", "d"}) {
    const pid_t child = ::fork();
    if (child == 0) {
      bool isKept = true;
      for (int i = 1; i <= rounds && isKept; ++i) {
        const Value before = readPreferencesFile(dir / "a.toml").values[key];
        std::error_code error;
        isKept = before.intValue() == i - 1 &&
                 updatePreferencesFile(dir / "a.toml", {{key, i}}, error, std::chrono::minutes(1));
      }
      ::_exit(isKept ? 0 : 1);
    }
    children.push_back(child);
  }
  for (const pid_t child : children) {
    int status = 1;
    ASSERT_EQ(::waitpid(child, &status, 0), child);
    EXPECT_EQ(status, 0);
  }
  const PreferencesFile file = readPreferencesFile(dir / "a.toml");
  EXPECT_EQ(file.values, (Dictionary{{"a", rounds}, {"b", rounds}, {"c", rounds}, {"d", rounds}}));
  EXPECT_TRUE(get(dir / "a.toml").starts_with("# kept\n"));
  EXPECT_EQ(filesIn(dir.path()), 1);
}

TEST(PreferencesError, HasATextForEachCode) {
  const std::error_code error = PreferencesError::busy;
  EXPECT_STREQ(error.category().name(), "oxmv.preferences");
  EXPECT_EQ(error.message(), "Another program keeps the preferences folder locked");
  EXPECT_EQ(error.category().message(99), "Unknown error");
}

}  // namespace
}  // namespace oxmv
