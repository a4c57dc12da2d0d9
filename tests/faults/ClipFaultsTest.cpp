// Clips in a file system that fails, and in a process that is killed.

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <csignal>
#include <filesystem>
#include <optional>
#include <string>
#include <system_error>
#include <utility>
#include <vector>

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sched.h>
#include <sys/mount.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include "oxmv/metadata/MetadataDictionary.h"
#include "oxmv/platform/WholeFile.h"
#include "oxmv/store/LastRecord.h"
#include "tests/faults/SystemCalls.h"
#include "tests/support/ChildProcess.h"
#include "tests/support/FakeHost.h"
#include "tests/support/Files.h"
#include "tests/support/StreamBuilder.h"
#include "tests/support/TempDir.h"

namespace oxmv::test {
namespace {

namespace fs = std::filesystem;

constexpr myGUID guid = {1, 2, 3, {4, 5, 6, 7, 8, 9, 10, 11}};
const std::string fileName = "00000001-0002-0003-0405-060708090A0B.colr";
const std::string linkedName = "elsewhere";  // of a file that it may be a link to

const Bytes oldContent = StreamBuilder().record("REEL", 'c', "A001\0\0\0\0").bytes();
const Bytes newContent = {'R', 'E', 'E', 'L', 8,   0,   0, 'c', 'B', '0', '0', '2', 0, 0,
                          0,   0,   'T', 'A', 'K', 'E', 4, 0,   0,   'B', 3,   0,   0, 0};

MetadataDictionary newClip() {
  auto clip = MetadataDictionary::initFromGUID(guid);
  clip.setMetadata(Dictionary{{"REEL", "B002"}, {"TAKE", 3}});
  return clip;
}

bool isOldOrNew(const Dictionary& tags) {
  return tags == Dictionary{{"REEL", "A001"}} || tags == Dictionary{{"REEL", "B002"}, {"TAKE", 3}};
}

bool isTemporary(const std::string& name) {
  return name.starts_with(".oxmv-") && name.ends_with(".tmp");
}

// A database in a folder of the test's own.
class Database {
 public:
  Database() : dir_(std::in_place) { place(dir_->path()); }
  explicit Database(const fs::path& folder) { place(folder); }

  const fs::path& folder() const { return folder_; }
  fs::path file() const { return folder_ / fileName; }

 private:
  void place(const fs::path& folder) {
    folder_ = folder / "db";
    fs::create_directory(folder_);
    host_->preferences[std::string(preferencesAppID)]["LUTsPath"] = folder.string();
  }

  std::optional<TempDir> dir_;
  fs::path folder_;
  InstalledFakeHost host_;
};

// How a process ended that saved the new clip with a fault armed.
struct Ending {
  bool wasKilled = false;
  bool hasSaved = false;
  std::string function;  // of the faulty call; empty if the process made fewer calls
};

Ending saveWithFault(std::size_t nth, const Fault& fault) {
  int pipes[2] = {};
  EXPECT_EQ(::pipe(pipes), 0);
  const pid_t child = startChild([&] {
    const MetadataDictionary clip = newClip();
    std::error_code error;
    armFault(nth, fault);
    const bool hasSaved = clip.writeToGUIDFile(&error);
    disarmFault();
    const std::string function = faultyFunction();
    const bool isTold = ::write(pipes[1], function.data(), function.size()) >= 0;
    // A failure has a reason.
    const bool isGood = isTold && (hasSaved || error);
    return !isGood ? 2 : hasSaved ? 0 : 1;
  });
  ::close(pipes[1]);
  Ending ending;
  char buffer[32];
  for (ssize_t size = 0; (size = ::read(pipes[0], buffer, sizeof buffer)) > 0;)
    ending.function.append(buffer, static_cast<std::size_t>(size));
  ::close(pipes[0]);
  int status = 0;
  EXPECT_EQ(::waitpid(child, &status, 0), child);
  ending.wasKilled = WIFSIGNALED(status) && WTERMSIG(status) == SIGKILL;
  EXPECT_TRUE(ending.wasKilled || (WIFEXITED(status) && WEXITSTATUS(status) < 2)) << status;
  ending.hasSaved = WIFEXITED(status) && WEXITSTATUS(status) == 0;
  return ending;
}

// What stands in the folder beside the clip's file must be leftovers of a killed process, which
// nobody takes for a clip; answers how many there are.
std::size_t leftoversIn(const Database& database) {
  std::size_t count = 0;
  for (const std::string& name : namesIn(database.folder())) {
    if (name == fileName || name == linkedName) continue;
    EXPECT_TRUE(isTemporary(name)) << name;
    ++count;
  }
  return count;
}

void removeLeftovers(const Database& database) {
  for (const std::string& name : namesIn(database.folder())) {
    if (isTemporary(name)) fs::remove(database.folder() / name);
  }
}

// What stands where a clip is saved.
enum class Old { none, file, link };

class ClipFaults : public testing::TestWithParam<Old> {
 protected:
  static bool hasOld() { return GetParam() != Old::none; }

  void putOld() const {
    fs::remove(database.file());
    if (GetParam() == Old::link) fs::create_symlink(linkedName, database.file());
    if (hasOld()) putFile(database.file(), oldContent);
  }
  bool isOld() const {
    return hasOld() ? getFile(database.file()) == oldContent : !fs::exists(database.file());
  }
  bool isNew() const {
    return getFile(database.file()) == newContent &&
           fs::is_symlink(database.file()) == (GetParam() == Old::link);
  }

  Database database;
};

INSTANTIATE_TEST_SUITE_P(Save, ClipFaults, testing::Values(Old::none, Old::file, Old::link),
                         [](const auto& old) {
                           switch (old.param) {
                             case Old::none: return "OfANewClip";
                             case Old::file: return "ReplacingAClip";
                             case Old::link: return "ThroughALink";
                           }
                           return "";
                         });

TEST_P(ClipFaults, KilledAtAnyCallLeavesTheOldFileOrTheNew) {
  for (const auto kind : {Fault::Kind::killBefore, Fault::Kind::killAfter}) {
    bool wasNew = false;
    std::size_t kills = 0;
    for (std::size_t nth = 1;; ++nth) {
      ASSERT_LT(nth, 100u);
      putOld();
      const Ending ending = saveWithFault(nth, {.kind = kind});
      if (!ending.wasKilled) {
        EXPECT_TRUE(ending.hasSaved);
        break;
      }
      ++kills;
      EXPECT_TRUE(isOld() || isNew()) << nth;
      EXPECT_FALSE(wasNew && isOld()) << nth;  // there is one moment of change
      wasNew = isNew();
      EXPECT_LE(leftoversIn(database), 1u);
      // Whoever comes later is not disturbed.
      const auto clip = MetadataDictionary::initFromGUID(guid);
      EXPECT_EQ(clip.metadata()["REEL"].text(), isNew() ? "B002" : hasOld() ? "A001" : "");
      EXPECT_TRUE(newClip().writeToGUIDFile());
      EXPECT_TRUE(isNew());
      removeLeftovers(database);
    }
    EXPECT_GT(kills, 10u);  // there are ten writes alone
    EXPECT_TRUE(wasNew);
  }
}

TEST_P(ClipFaults, FailureOfAnyCallIsToldAndLeavesTheOldFile) {
  for (const int error : {ENOSPC, EIO, EDQUOT}) {
    for (const bool isLasting : {false, true}) {
      std::size_t failures = 0;
      for (std::size_t nth = 1;; ++nth) {
        ASSERT_LT(nth, 100u);
        putOld();
        const Ending ending =
            saveWithFault(nth, {.kind = Fault::Kind::fail, .error = error, .isLasting = isLasting});
        EXPECT_FALSE(ending.wasKilled);
        EXPECT_EQ(leftoversIn(database), 0u) << ending.function;
        if (ending.function.empty()) break;
        if (ending.hasSaved) {
          EXPECT_TRUE(isNew()) << ending.function;
        } else {
          ++failures;
          // Once the file has its name, all that can fail is to make the name last.
          EXPECT_TRUE(isOld() || (isNew() && ending.function == "fsync")) << ending.function;
        }
      }
      EXPECT_GT(failures, 10u);
    }
  }
}

TEST_P(ClipFaults, InterruptedCallsAreTakenUpAgain) {
  std::size_t interrupted = 0;
  for (std::size_t nth = 1;; ++nth) {
    ASSERT_LT(nth, 100u);
    putOld();
    const Ending ending = saveWithFault(nth, {.kind = Fault::Kind::fail, .error = EINTR});
    if (ending.function.empty()) break;
    if (ending.function != "write" && ending.function != "getrandom") continue;
    ++interrupted;
    EXPECT_TRUE(ending.hasSaved);
    EXPECT_TRUE(isNew());
  }
  EXPECT_GT(interrupted, newContent.size() / 3);
}

TEST(ClipFault, FailureOfAnyCallWhileLoadingIsRemembered) {
  const Database database;
  putFile(database.file(), oldContent);
  std::size_t failures = 0;
  for (std::size_t nth = 1;; ++nth) {
    ASSERT_LT(nth, 100u);
    armFault(nth, {.kind = Fault::Kind::fail, .error = EIO});
    const auto clip = MetadataDictionary::initFromGUID(guid);
    disarmFault();
    if (faultyFunction().empty()) break;
    if (clip.haveMetadata()) {
      EXPECT_EQ(faultyFunction(), "close");
      continue;
    }
    ++failures;
    EXPECT_EQ(clip.loadError(), LoadError::unreadable);
    EXPECT_EQ(clip.loadErrorCode(), std::errc::io_error);
  }
  // open, fstat, two reads, of which the second finds the end, and fstat again
  EXPECT_EQ(failures, 5u);
}

// As where the file system has no permissions of its own.
TEST(ClipFault, PermissionsThatCannotBeGivenAreDoneWithout) {
  const Database database;
  for (const int error : {EPERM, ENOTSUP, EIO}) {
    for (const mode_t mode : {0666u, 0600u, 0400u}) {
      fs::remove(database.file());
      putFile(database.file(), oldContent);
      ASSERT_EQ(::chmod(database.file().c_str(), mode), 0);
      const MetadataDictionary clip = newClip();
      std::error_code cause;
      armFault(1, {.kind = Fault::Kind::fail, .error = error, .function = "fchmod"});
      const bool hasSaved = clip.writeToGUIDFile(&cause);
      disarmFault();
      ASSERT_EQ(faultyFunction(), "fchmod");
      // The new file is the owner's to read and to write.
      EXPECT_EQ(hasSaved, error != EIO && mode != 0400u) << error << ' ' << mode;
      EXPECT_EQ(getFile(database.file()), hasSaved ? newContent : oldContent);
      EXPECT_EQ(cause.value(), hasSaved ? 0 : error);
      EXPECT_EQ(namesIn(database.folder()), std::set<std::string>{fileName});
    }
  }
}

TEST(ClipFault, ReplacingAClipTakesTheseCallsInThisOrder) {
  const Database database;
  putFile(database.file(), oldContent);
  ASSERT_EQ(::chmod(database.file().c_str(), 0640), 0);
  const MetadataDictionary clip = newClip();
  armFault(0, {});
  const bool hasSaved = clip.writeToGUIDFile();
  disarmFault();
  EXPECT_TRUE(hasSaved);
  std::vector<SystemCall> expected = {
      {.function = "readlink"},
      {.function = "lstat"},
      {.function = "open", .flags = O_RDONLY | O_DIRECTORY | O_CLOEXEC},
      {.function = "getrandom"},
      {.function = "open", .flags = O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, .mode = 0600}};
  expected.insert(expected.end(), (newContent.size() + 2) / 3, {.function = "write"});
  for (const SystemCall& call :
       std::vector<SystemCall>{{.function = "fchown"},  // the group, then the owner
                               {.function = "fchown"},
                               {.function = "fchmod", .mode = 0640},
                               {.function = "fsync"},
                               {.function = "close"},
                               {.function = "rename"},
                               {.function = "fsync"},  // the folder
                               {.function = "close"}})
    expected.push_back(call);
  const auto namesOf = [](const std::vector<SystemCall>& calls) {
    std::string names;
    for (const SystemCall& call : calls) names += call.function + ' ';
    return names;
  };
  EXPECT_EQ(namesOf(systemCalls()), namesOf(expected));
  EXPECT_TRUE(systemCalls() == expected);
}

TEST(ClipFault, FolderThatCannotBeSynchronisedIsDoneWithout) {
  const Database database;
  for (const int error : {EINVAL, ENOTSUP, EIO}) {
    putFile(database.file(), oldContent);
    const MetadataDictionary clip = newClip();
    std::error_code cause;
    armFault(2, {.kind = Fault::Kind::fail, .error = error, .function = "fsync"});
    const bool hasSaved = clip.writeToGUIDFile(&cause);
    disarmFault();
    EXPECT_EQ(faultyFunction(), "fsync");
    EXPECT_EQ(hasSaved, error != EIO);
    EXPECT_EQ(cause.value(), hasSaved ? 0 : EIO);
    EXPECT_EQ(getFile(database.file()), newContent);
  }
}

// The head of the "last" file is read first, and stays.
TEST(ClipFault, FailureBehindTheGuidOfTheLastFileKeepsTheGuid) {
  const Database database;
  const fs::path file = database.folder() / "last";
  Bytes content(sizeof(myGUID) + oldContent.size(), 9);
  std::copy(oldContent.begin(), oldContent.end(), content.end() - std::ssize(oldContent));
  putFile(file, content);
  std::size_t zeros = 0;
  std::size_t guids = 0;
  for (std::size_t nth = 1;; ++nth) {
    ASSERT_LT(nth, 100u);
    std::error_code error;
    armFault(nth, {.kind = Fault::Kind::fail, .error = EIO});
    const LastRecord last = readLastRecord(file, error);
    disarmFault();
    if (faultyFunction().empty()) break;
    if (faultyFunction() == "close") continue;
    EXPECT_EQ(error, std::errc::io_error);
    EXPECT_EQ(last.stream, std::nullopt);
    ++(last.guid.Data1 == 0 ? zeros : guids);
    EXPECT_EQ(last.guidSize, last.guid.Data1 == 0 ? 0 : sizeof(myGUID));
  }
  EXPECT_EQ(zeros, 3u);  // open, fstat, and the read of the GUID
  EXPECT_EQ(guids, 2u);  // the read of the rest, and that of the end
}

TEST(ClipFault, RemovalThatFailsIsTold) {
  const Database database;
  const fs::path file = database.folder() / (fileName.substr(0, 37) + "col1");
  putFile(file, oldContent);
  auto clip = MetadataDictionary::initFromGUIDForSingleEye(guid, 0);
  clip.setMetadata(std::nullopt);
  std::vector<std::string> functions;
  for (std::size_t nth = 1;; ++nth) {
    ASSERT_LT(nth, 100u);
    putFile(file, oldContent);
    std::error_code error;
    armFault(nth, {.kind = Fault::Kind::fail, .error = EROFS});
    const bool hasSaved = clip.writeToGUIDFile(&error);
    disarmFault();
    const std::string function = faultyFunction();
    if (function.empty()) break;
    functions.push_back(function);
    EXPECT_EQ(hasSaved, function == "close");
    EXPECT_EQ(error.value(), hasSaved ? 0 : EROFS);
    EXPECT_EQ(fs::exists(file), function == "open" || function == "unlink");
  }
  // The folder is synchronised, so that the file does not come back after a crash.
  EXPECT_EQ(functions, (std::vector<std::string>{"open", "unlink", "fsync", "close"}));
}

// Puts a file system of a few kilobytes at `folder`, which only this process sees.
bool mountSmallDisk(const fs::path& folder) {
  const uid_t user = ::geteuid();
  const gid_t group = ::getegid();
  if (user == 0) {
    if (::unshare(CLONE_NEWNS) != 0) return false;
  } else {
    // Root in a world of its own, where it owns the files that it makes.
    if (::unshare(CLONE_NEWUSER | CLONE_NEWNS) != 0) return false;
    putFile("/proc/self/setgroups", bytesOf("deny"));
    putFile("/proc/self/uid_map", bytesOf("0 " + std::to_string(user) + " 1"));
    putFile("/proc/self/gid_map", bytesOf("0 " + std::to_string(group) + " 1"));
  }
  if (::mount(nullptr, "/", nullptr, MS_REC | MS_PRIVATE, nullptr) != 0 ||
      ::mount("tmpfs", folder.c_str(), "tmpfs", 0, "size=16k") != 0)
    return false;
  std::error_code error;
  return fs::create_directory(folder / "db", error);
}

TEST(ClipFault, FullDiskLeavesTheOldFile) {
  const TempDir dir;
  constexpr int cannotMount = 77;
  const pid_t child = startChild([&] {
    if (!mountSmallDisk(dir.path())) return cannotMount;
    const Database database(dir.path());
    putFile(database.file(), oldContent);
    const fs::path filler = dir / "filler";
    putFile(filler, Bytes(64 << 10, 'x'));  // as much of it as there is room for
    std::error_code error;
    const bool isFull = fs::file_size(filler) < (64 << 10) && !newClip().writeToGUIDFile(&error) &&
                        error == std::errc::no_space_on_device;
    const bool isOld = getFile(database.file()) == oldContent &&
                       namesIn(database.folder()) == std::set<std::string>{fileName};
    fs::remove(filler);
    const bool isGoodAgain = newClip().writeToGUIDFile() && getFile(database.file()) == newContent;
    return isFull && isOld && isGoodAgain ? 0 : 1;
  });
  const int status = exitStatusOf(child);
  if (status == cannotMount) GTEST_SKIP() << "this process may not mount";
  EXPECT_EQ(status, 0);
}

// The default folder, in a process whose root is a folder of the test's.
TEST(ClipFault, OverrideIsWrittenIntoTheDefaultFolderWhichIsStored) {
  const TempDir dir;
  fs::create_directories(dir / "Library/Application Support/Ombrix");
  constexpr int cannotMove = 77;
  const pid_t child = startChild([&] {
    if (::geteuid() != 0 && ::unshare(CLONE_NEWUSER) != 0) return cannotMove;
    if (::chroot(dir.path().c_str()) != 0 || ::chdir("/") != 0) return cannotMove;
    const InstalledFakeHost host;
    if (!newClip().writeToOverride()) return 1;
    const Value stored = host->preferences[std::string(preferencesAppID)]["OverridePath"];
    return stored == Value("/Library/Application Support/Ombrix") ? 0 : 2;
  });
  const int status = exitStatusOf(child);
  if (status == cannotMove) GTEST_SKIP() << "this process may not change its root";
  EXPECT_EQ(status, 0);
  EXPECT_EQ(getFile(dir / "Library/Application Support/Ombrix/override.colr"), newContent);
}

// Several processes at once.

int saveOften(const Value& reel, int count) {
  auto clip = MetadataDictionary::initFromGUID(guid);
  clip.setMetadata(Dictionary{{"REEL", reel}});
  for (int i = 0; i < count; ++i) {
    if (!clip.writeToGUIDFile()) return 1;
  }
  return 0;
}

TEST(ClipFault, ReadersSeeOneOfTwoWritersWhole) {
  const Database database;
  // Of different sizes: a file that is replaced while it is read must not come out as a mixture.
  const std::string longReel(200, 'L');
  ASSERT_EQ(saveOften("short", 1), 0);
  const pid_t one = startChild([&] { return saveOften("short", 300); });
  const pid_t other = startChild([&] { return saveOften(longReel, 300); });
  int wrong = 0;
  for (int i = 0; i < 3000; ++i) {
    const auto clip = MetadataDictionary::initFromGUID(guid);
    const std::string reel = clip.metadata()["REEL"].text();
    if (clip.loadError() != LoadError::none || (reel != "short" && reel != longReel)) ++wrong;
  }
  EXPECT_EQ(wrong, 0);
  EXPECT_EQ(exitStatusOf(one), 0);
  EXPECT_EQ(exitStatusOf(other), 0);
  EXPECT_EQ(namesIn(database.folder()), std::set<std::string>{fileName});
}

TEST(ClipFault, FileReplacedWhileItIsReadIsOneOfTheTwoWhole) {
  const Database database;
  std::size_t old = 0;
  std::size_t replaced = 0;
  for (std::size_t nth = 1;; ++nth) {
    ASSERT_LT(nth, 100u);
    putFile(database.file(), oldContent);
    armFault(nth, {.kind = Fault::Kind::meanwhile,
                   .action = [] { EXPECT_TRUE(newClip().writeToGUIDFile()); }});
    const auto clip = MetadataDictionary::initFromGUID(guid);
    disarmFault();
    if (faultyFunction().empty()) break;
    EXPECT_TRUE(isOldOrNew(clip.metadata()));
    ++(clip.metadata()["REEL"].text() == "A001" ? old : replaced);
    EXPECT_EQ(clip.loadError(), LoadError::none);
    EXPECT_EQ(getFile(database.file()), newContent);
  }
  EXPECT_EQ(replaced, 1u);  // before it was opened
  EXPECT_EQ(old, 5u);
}

// By one who does not put a new file in its place, as the library does, but writes into the old
// one.
TEST(ClipFault, FileRewrittenWhileItIsReadIsReadOnceMore) {
  const Database database;
  // Of one length, and too long for one read.
  const Bytes old(100, 'o');
  const Bytes rewritten(100, 'r');
  std::size_t count = 0;
  for (std::size_t nth = 1;; ++nth) {
    ASSERT_LT(nth, 100u);
    putFile(database.file(), old);
    // Long ago: a file system may tell times by the hundredth of a second.
    fs::last_write_time(database.file(), fs::file_time_type::clock::now() - std::chrono::hours(1));
    armFault(nth, {.kind = Fault::Kind::meanwhile,
                   .action = [&] { putFile(database.file(), rewritten); }});
    std::error_code error;
    const auto content = readWholeFile(database.file(), error);
    disarmFault();
    if (faultyFunction().empty()) break;
    ++count;
    EXPECT_FALSE(error);
    EXPECT_EQ(content, faultyFunction() == "close" ? old : rewritten) << nth;
  }
  EXPECT_EQ(count, 6u);
}

TEST(ClipFault, FileThatIsRewrittenAgainAndAgainIsNotRead) {
  const Database database;
  putFile(database.file(), oldContent);
  auto time = fs::file_time_type::clock::now();
  armFault(1, {.kind = Fault::Kind::meanwhile,
               .isLasting = true,
               .action =
                   [&] {
                     putFile(database.file(), newContent);
                     fs::last_write_time(database.file(), time += std::chrono::seconds(1));
                   },
               .function = "read"});
  const auto clip = MetadataDictionary::initFromGUID(guid);
  disarmFault();
  EXPECT_EQ(clip.loadError(), LoadError::unreadable);
  EXPECT_EQ(clip.loadErrorCode(), FileError::changed);
  EXPECT_FALSE(clip.haveMetadata());
}

// Whoever says what the file held when it was read does not overwrite what came since.
TEST(ClipFault, FileReplacedWhileItIsEditedIsNotOverwritten) {
  const Database database;
  const Bytes others = bytesOf("somebody else's");
  std::size_t refusals = 0;
  for (std::size_t nth = 1;; ++nth) {
    ASSERT_LT(nth, 100u);
    putFile(database.file(), oldContent);
    armFault(nth,
             {.kind = Fault::Kind::meanwhile, .action = [&] { putFile(database.file(), others); }});
    std::error_code error;
    const bool isReplaced = replaceWholeFile(database.file(), oldContent, newContent, error);
    disarmFault();
    const std::string function = faultyFunction();
    if (function.empty()) break;
    EXPECT_EQ(namesIn(database.folder()), std::set<std::string>{fileName});
    if (isReplaced) continue;
    ++refusals;
    EXPECT_EQ(error, FileError::changed) << function;
    EXPECT_EQ(getFile(database.file()), others) << function;
  }
  EXPECT_GT(refusals, 10u);
}

// Nor does whoever says that there was none.
TEST(ClipFault, FileMadeWhileANewOneIsWrittenIsNotOverwritten) {
  const TempDir folder;
  const Bytes others = bytesOf("somebody else's");
  armFault(1, {.kind = Fault::Kind::meanwhile,
               .action = [&] { putFile(folder / "clip", others); },
               .function = "fsync"});
  std::error_code error;
  EXPECT_FALSE(writeNewFile(folder / "clip", newContent, error));
  disarmFault();
  EXPECT_EQ(faultyFunction(), "fsync");
  EXPECT_EQ(error, std::errc::file_exists);
  EXPECT_EQ(getFile(folder / "clip"), others);
  EXPECT_EQ(namesIn(folder.path()), std::set<std::string>{"clip"});
}

}  // namespace
}  // namespace oxmv::test
