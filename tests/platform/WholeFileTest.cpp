#include <algorithm>
#include <csignal>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <new>
#include <string>
#include <vector>

#include <gtest/gtest.h>
#include <sys/mman.h>
#include <sys/resource.h>
#include <sys/stat.h>

#include "oxmv/platform/WholeFile.h"
#include "tests/support/ChildProcess.h"
#include "tests/support/Files.h"
#include "tests/support/LeasedFile.h"
#include "tests/support/Memory.h"
#include "tests/support/TempDir.h"

namespace oxmv {
namespace {

namespace fs = std::filesystem;
using test::asOrdinaryUser;
using test::Bytes;
using test::TempDir;

const Bytes oldContent = {'o', 'l', 'd'};
const Bytes newContent = {'n', 'e', 'w', 0, 0xFF};

mode_t modeOf(const fs::path& path) {
  struct stat status = {};
  EXPECT_EQ(::lstat(path.c_str(), &status), 0);
  return status.st_mode & 07777;
}

TEST(ReadWholeFile, GivesTheContent) {
  const TempDir folder;
  test::putFile(folder / "clip", newContent);
  std::error_code error = std::make_error_code(std::errc::io_error);
  EXPECT_EQ(readWholeFile(folder / "clip", error), newContent);
  EXPECT_FALSE(error);
}

TEST(ReadWholeFile, GivesNoBytesOfAnEmptyFile) {
  const TempDir folder;
  test::putFile(folder / "empty", {});
  std::error_code error;
  EXPECT_EQ(readWholeFile(folder / "empty", error), Bytes());
}

TEST(ReadWholeFile, ReadsPastTheSizeThatTheSystemNames) {
  std::error_code error;
  const auto content =
      readWholeFile("/proc/self/status", error);  // a regular file that says it is empty
  ASSERT_TRUE(content);
  EXPECT_GT(content->size(), 100u);
}

TEST(ReadWholeFile, SaysThatThereIsNoSuchFile) {
  const TempDir folder;
  std::error_code error;
  EXPECT_FALSE(readWholeFile(folder / "absent", error));
  EXPECT_EQ(error, std::errc::no_such_file_or_directory);
}

TEST(ReadWholeFile, RefusesAFolder) {
  const TempDir folder;
  std::error_code error;
  EXPECT_FALSE(readWholeFile(folder.path(), error));
  EXPECT_EQ(error, std::errc::is_a_directory);
}

TEST(ReadWholeFile, RefusesAPipeWithoutWaitingForIt) {
  const TempDir folder;
  ASSERT_EQ(::mkfifo((folder / "pipe").c_str(), 0600), 0);
  std::error_code error;
  EXPECT_FALSE(readWholeFile(folder / "pipe", error));
  EXPECT_EQ(error, FileError::notRegular);
  EXPECT_EQ(error.message(), "Not a regular file");
}

TEST(ReadWholeFile, WaitsForAFileThatAnotherProcessHasForItself) {
  const TempDir folder;
  test::putFile(folder / "clip", newContent);
  const test::LeasedFile lease(folder / "clip");
  if (!lease.isHeld()) GTEST_SKIP() << "no leases here";
  std::error_code error;
  EXPECT_EQ(readWholeFile(folder / "clip", error), newContent);
  EXPECT_FALSE(error);
}

TEST(ReadWholeFile, ReadsAsMuchAsTheLimit) {
  const TempDir folder;
  test::putFile(folder / "large", newContent);
  fs::resize_file(folder / "large", maxFileSize);  // sparse
  std::error_code error;
  const auto content = readWholeFile(folder / "large", error);
  ASSERT_TRUE(content);
  EXPECT_EQ(content->size(), maxFileSize);
  EXPECT_TRUE(std::equal(newContent.begin(), newContent.end(), content->begin()));
}

TEST(ReadWholeFile, RefusesMoreThanTheLimit) {
  const TempDir folder;
  test::putFile(folder / "large", {});
  fs::resize_file(folder / "large", maxFileSize + 1);  // sparse
  std::error_code error;
  EXPECT_FALSE(readWholeFile(folder / "large", error));
  EXPECT_EQ(error, FileError::tooLarge);
}

TEST(ReadWholeFile, SaysThatTheFileMayNotBeRead) {
  const TempDir folder;
  fs::permissions(folder.path(), fs::perms::all);
  test::putFile(folder / "secret", oldContent);
  fs::permissions(folder / "secret", fs::perms::none);
  EXPECT_TRUE(asOrdinaryUser([&] {
    std::error_code error;
    return !readWholeFile(folder / "secret", error) && error == std::errc::permission_denied;
  }));
}

TEST(ReadWholeFile, RefusesANameWithANulInIt) {
  const TempDir dir;
  test::putFile(dir / "clip", oldContent);
  std::error_code error;
  EXPECT_EQ(readWholeFile(dir / std::string("clip\0.colr", 10), error), std::nullopt);
  EXPECT_EQ(error, std::errc::invalid_argument);
}

TEST(ReadFileStart, GivesAsManyBytesAsAreAskedFor) {
  const TempDir dir;
  test::putFile(dir / "clip", newContent);
  std::error_code error = FileError::tooLarge;
  EXPECT_EQ(readFileStart(dir / "clip", 3, error), (Bytes{'n', 'e', 'w'}));
  EXPECT_FALSE(error);
  EXPECT_EQ(readFileStart(dir / "clip", 5, error), newContent);
  EXPECT_EQ(readFileStart(dir / "clip", 0, error), Bytes());
}

TEST(ReadFileStart, GivesAllOfAFileThatHasFewer) {
  const TempDir dir;
  test::putFile(dir / "clip", newContent);
  std::error_code error;
  EXPECT_EQ(readFileStart(dir / "clip", 64, error), newContent);
  EXPECT_FALSE(error);
}

TEST(ReadFileStart, LooksIntoAFileOfAnySize) {
  const TempDir dir;
  test::putFile(dir / "clip", newContent);
  fs::resize_file(dir / "clip",
                  std::uintmax_t{1} << 31);  // two gibibytes, none of them on the disk
  std::error_code error;
  EXPECT_EQ(readFileStart(dir / "clip", 5, error), newContent);
  EXPECT_EQ(readWholeFile(dir / "clip", error), std::nullopt);
  EXPECT_EQ(error, FileError::tooLarge);
}

TEST(ReadFileStart, SaysWhyThereIsNothingToRead) {
  const TempDir dir;
  std::error_code error;
  EXPECT_EQ(readFileStart(dir / "clip", 5, error), std::nullopt);
  EXPECT_EQ(error, std::errc::no_such_file_or_directory);
  EXPECT_EQ(readFileStart(dir.path(), 5, error), std::nullopt);
  EXPECT_EQ(error, std::errc::is_a_directory);
}

TEST(ReadBehindHead, GivesHeadAndRest) {
  const TempDir dir;
  test::putFile(dir / "clip", newContent);
  Bytes buffer(3);
  std::span<std::uint8_t> head = buffer;
  std::error_code error = FileError::tooLarge;
  EXPECT_EQ(readBehindHead(dir / "clip", head, error), (Bytes{0, 0xFF}));
  EXPECT_FALSE(error);
  EXPECT_EQ(head.size(), 3u);
  EXPECT_EQ(buffer, (Bytes{'n', 'e', 'w'}));
  buffer.resize(5);
  head = buffer;
  EXPECT_EQ(readBehindHead(dir / "clip", head, error), Bytes());
  EXPECT_EQ(buffer, newContent);
}

TEST(ReadBehindHead, CutsAHeadThatIsNotWhole) {
  const TempDir dir;
  test::putFile(dir / "clip", newContent);
  Bytes buffer(6, 7);
  std::span<std::uint8_t> head = buffer;
  std::error_code error;
  EXPECT_EQ(readBehindHead(dir / "clip", head, error), std::nullopt);
  EXPECT_FALSE(error);
  EXPECT_EQ(head.size(), 5u);
  EXPECT_EQ(buffer, (Bytes{'n', 'e', 'w', 0, 0xFF, 7}));
}

TEST(ReadBehindHead, HasTheHeadOfAFileThatIsTooLarge) {
  const TempDir dir;
  test::putFile(dir / "clip", newContent);
  fs::resize_file(dir / "clip", maxFileSize + 1);  // sparse
  Bytes buffer(5);
  std::span<std::uint8_t> head = buffer;
  std::error_code error;
  EXPECT_EQ(readBehindHead(dir / "clip", head, error), std::nullopt);
  EXPECT_EQ(error, FileError::tooLarge);
  EXPECT_EQ(head.size(), 5u);
  EXPECT_EQ(buffer, newContent);
}

TEST(ReadBehindHead, HasNoHeadOfAFileThatIsNotThere) {
  const TempDir dir;
  Bytes buffer(5);
  std::span<std::uint8_t> head = buffer;
  std::error_code error;
  EXPECT_EQ(readBehindHead(dir / "clip", head, error), std::nullopt);
  EXPECT_EQ(error, std::errc::no_such_file_or_directory);
  EXPECT_TRUE(head.empty());
}

TEST(WriteWholeFile, MakesANewFile) {
  const TempDir folder;
  const mode_t mask = ::umask(027);
  std::error_code error = std::make_error_code(std::errc::io_error);
  EXPECT_TRUE(writeWholeFile(folder / "clip", newContent, error));
  ::umask(mask);
  EXPECT_FALSE(error);
  EXPECT_EQ(test::getFile(folder / "clip"), newContent);
  EXPECT_EQ(modeOf(folder / "clip"), 0640u);
  EXPECT_EQ(test::namesIn(folder.path()).size(), 1u);
}

TEST(WriteWholeFile, TakesANameInTheCurrentFolder) {
  const TempDir folder;
  EXPECT_TRUE(test::inChildProcess([&] {
    fs::current_path(folder.path());
    std::error_code error;
    return writeWholeFile("file", Bytes{1, 2}, error) && writeWholeFile("file", Bytes{3}, error);
  }));
  EXPECT_EQ(test::getFile(folder / "file"), Bytes{3});
  EXPECT_EQ(test::namesIn(folder.path()), std::set<std::string>{"file"});
}

TEST(WriteWholeFile, ReplacesAFileAndKeepsItsPermissions) {
  const TempDir folder;
  test::putFile(folder / "clip", oldContent);
  ASSERT_EQ(::chmod((folder / "clip").c_str(), 0604), 0);
  std::error_code error;
  EXPECT_TRUE(writeWholeFile(folder / "clip", newContent, error));
  EXPECT_EQ(test::getFile(folder / "clip"), newContent);
  EXPECT_EQ(modeOf(folder / "clip"), 0604u);
  EXPECT_EQ(test::namesIn(folder.path()).size(), 1u);
}

TEST(WriteWholeFile, KeepsTheOwnerWhereTheSystemAllows) {
  if (::geteuid() != 0) GTEST_SKIP() << "files can be given to others by root only";
  const TempDir folder;
  const fs::path clip = folder / "clip";
  test::putFile(clip, oldContent);
  ASSERT_EQ(::chown(clip.c_str(), 1234, 4321), 0);
  ASSERT_EQ(::chmod(clip.c_str(), 06775), 0);  // after the owner: that takes such bits away
  std::error_code error;
  EXPECT_TRUE(writeWholeFile(clip, newContent, error));
  struct stat status = {};
  ASSERT_EQ(::stat(clip.c_str(), &status), 0);
  EXPECT_EQ(status.st_uid, 1234u);
  EXPECT_EQ(status.st_gid, 4321u);
  EXPECT_EQ(modeOf(clip), 06775u);

  // Somebody who may not give it away lets nobody run it as himself, nor his group use it.
  fs::permissions(folder.path(), fs::perms::all);
  EXPECT_TRUE(asOrdinaryUser([&] { return writeWholeFile(clip, oldContent, error); }));
  ASSERT_EQ(::stat(clip.c_str(), &status), 0);
  EXPECT_EQ(status.st_uid, 65534u);
  EXPECT_EQ(status.st_gid, 65534u);
  EXPECT_EQ(modeOf(clip), 0705u);
}

TEST(WriteWholeFile, NeedsNotReadTheFolder) {
  const TempDir folder;
  test::putFile(folder / "clip", oldContent);
  fs::permissions(folder / "clip", fs::perms::owner_read | fs::perms::others_read);
  fs::permissions(folder.path(), fs::perms::owner_write | fs::perms::owner_exec |
                                     fs::perms::others_write | fs::perms::others_exec);
  EXPECT_TRUE(asOrdinaryUser([&] {
    std::error_code error;
    return writeWholeFile(folder / "clip", newContent, error);
  }));
  fs::permissions(folder.path(), fs::perms::owner_all);
  EXPECT_EQ(test::getFile(folder / "clip"), newContent);
  EXPECT_EQ(test::namesIn(folder.path()).size(), 1u);
}

TEST(WriteWholeFile, LeavesTheOldContentToThoseWhoHaveItOpen) {
  const TempDir folder;
  test::putFile(folder / "clip", oldContent);
  std::ifstream reader(folder / "clip", std::ios::binary);
  std::error_code error;
  EXPECT_TRUE(writeWholeFile(folder / "clip", newContent, error));
  EXPECT_EQ(Bytes(std::istreambuf_iterator<char>(reader), {}), oldContent);
}

TEST(WriteWholeFile, WritesAnEmptyFile) {
  const TempDir folder;
  test::putFile(folder / "clip", oldContent);
  std::error_code error;
  EXPECT_TRUE(writeWholeFile(folder / "clip", {}, error));
  EXPECT_EQ(fs::file_size(folder / "clip"), 0u);
}

TEST(WriteWholeFile, RefusesMoreThanCanBeReadAgain) {
  const TempDir folder;
  test::putFile(folder / "clip", oldContent);
  // Pages that nobody looks at take no memory.
  constexpr std::size_t size = maxFileSize + 1;
  void* const pages =
      ::mmap(nullptr, size, PROT_READ, MAP_PRIVATE | MAP_ANONYMOUS | MAP_NORESERVE, -1, 0);
  ASSERT_NE(pages, MAP_FAILED);
  const std::span content(static_cast<const std::uint8_t*>(pages), size);
  std::error_code error;
  EXPECT_FALSE(writeWholeFile(folder / "clip", content, error));
  EXPECT_EQ(error, FileError::tooLarge);
  EXPECT_FALSE(replaceWholeFile(folder / "clip", oldContent, content, error));
  EXPECT_EQ(error, FileError::tooLarge);
  EXPECT_FALSE(writeWholeFile(folder / "absent/clip", content, error));
  EXPECT_EQ(error, FileError::tooLarge);  // before anything is touched
  EXPECT_EQ(test::getFile(folder / "clip"), oldContent);
  EXPECT_EQ(test::namesIn(folder.path()).size(), 1u);
  ::munmap(pages, size);
}

TEST(WriteWholeFile, FollowsSymbolicLinks) {
  const TempDir folder;
  fs::create_directory(folder / "inner");
  test::putFile(folder / "inner/clip", oldContent);
  fs::create_symlink("inner/clip", folder / "relative");
  fs::create_symlink(folder / "relative", folder / "absolute");
  std::error_code error;
  EXPECT_TRUE(writeWholeFile(folder / "absolute", newContent, error));
  EXPECT_TRUE(fs::is_symlink(folder / "absolute"));
  EXPECT_TRUE(fs::is_symlink(folder / "relative"));
  EXPECT_EQ(test::getFile(folder / "inner/clip"), newContent);
}

TEST(WriteWholeFile, MakesTheFileThatALinkLeadsTo) {
  const TempDir folder;
  fs::create_symlink("target", folder / "link");
  std::error_code error;
  EXPECT_TRUE(writeWholeFile(folder / "link", newContent, error));
  EXPECT_TRUE(fs::is_symlink(folder / "link"));
  EXPECT_EQ(test::getFile(folder / "target"), newContent);
}

TEST(WriteWholeFile, FollowsAsManyLinksAsTheSystemDoes) {
  const TempDir folder;
  test::putFile(folder / "0", oldContent);
  for (int link = 1; link <= 41; ++link)
    fs::create_symlink(std::to_string(link - 1), folder / std::to_string(link));
  std::error_code error;
  EXPECT_TRUE(writeWholeFile(folder / "40", newContent, error));
  EXPECT_EQ(readWholeFile(folder / "40", error), newContent);
  EXPECT_FALSE(writeWholeFile(folder / "41", oldContent, error));
  EXPECT_EQ(error, std::errc::too_many_symbolic_link_levels);
  EXPECT_EQ(readWholeFile(folder / "41", error), std::nullopt);
  EXPECT_EQ(error, std::errc::too_many_symbolic_link_levels);
  EXPECT_EQ(test::getFile(folder / "0"), newContent);
}

TEST(WriteWholeFile, RefusesLinksThatLeadInACircle) {
  const TempDir folder;
  fs::create_symlink("b", folder / "a");
  fs::create_symlink("a", folder / "b");
  std::error_code error;
  EXPECT_FALSE(writeWholeFile(folder / "a", newContent, error));
  EXPECT_EQ(error, std::errc::too_many_symbolic_link_levels);
}

TEST(WriteWholeFile, RefusesAFolder) {
  const TempDir folder;
  fs::create_directory(folder / "inner");
  std::error_code error;
  EXPECT_FALSE(writeWholeFile(folder / "inner", newContent, error));
  EXPECT_EQ(error, std::errc::is_a_directory);
  EXPECT_TRUE(fs::is_directory(folder / "inner"));
}

TEST(WriteWholeFile, RefusesAPipe) {
  const TempDir folder;
  ASSERT_EQ(::mkfifo((folder / "pipe").c_str(), 0600), 0);
  std::error_code error;
  EXPECT_FALSE(writeWholeFile(folder / "pipe", newContent, error));
  EXPECT_EQ(error, FileError::notRegular);
  EXPECT_TRUE(fs::is_fifo(folder / "pipe"));
}

TEST(WriteWholeFile, MakesNoFolders) {
  const TempDir folder;
  std::error_code error;
  EXPECT_FALSE(writeWholeFile(folder / "absent/clip", newContent, error));
  EXPECT_EQ(error, std::errc::no_such_file_or_directory);
  EXPECT_EQ(test::namesIn(folder.path()).size(), 0u);
}

TEST(WriteWholeFile, SaysThatTheFolderMayNotBeWritten) {
  const TempDir folder;
  test::putFile(folder / "clip", oldContent);
  fs::permissions(folder.path(), fs::perms::owner_read | fs::perms::owner_exec |
                                     fs::perms::others_read | fs::perms::others_exec);
  EXPECT_TRUE(asOrdinaryUser([&] {
    std::error_code error;
    return !writeWholeFile(folder / "clip", newContent, error) &&
           error == std::errc::permission_denied;
  }));
  fs::permissions(folder.path(), fs::perms::owner_all);
  EXPECT_EQ(test::getFile(folder / "clip"), oldContent);
}

TEST(WriteWholeFile, KeepsTheOldFileAndNothingElseWhenWritingFails) {
  const TempDir folder;
  test::putFile(folder / "clip", oldContent);
  struct rlimit before = {};
  ASSERT_EQ(::getrlimit(RLIMIT_FSIZE, &before), 0);
  const auto handler = std::signal(SIGXFSZ, SIG_IGN);
  const struct rlimit small = {4096, before.rlim_max};
  ASSERT_EQ(::setrlimit(RLIMIT_FSIZE, &small), 0);

  std::error_code error;
  const bool written = writeWholeFile(folder / "clip", Bytes(8192, 1), error);

  ASSERT_EQ(::setrlimit(RLIMIT_FSIZE, &before), 0);
  std::signal(SIGXFSZ, handler);
  EXPECT_FALSE(written);
  EXPECT_EQ(error, std::errc::file_too_large);
  EXPECT_EQ(test::getFile(folder / "clip"), oldContent);
  EXPECT_EQ(test::namesIn(folder.path()).size(), 1u);
}

TEST(WriteWholeFile, RefusesANameWithANulInIt) {
  const TempDir dir;
  std::error_code error;
  EXPECT_FALSE(writeWholeFile(dir / std::string("clip\0.colr", 10), newContent, error));
  EXPECT_EQ(error, std::errc::invalid_argument);
  EXPECT_EQ(test::namesIn(dir.path()).size(), 0u);
}

TEST(RemoveFile, RemovesAFile) {
  const TempDir dir;
  test::putFile(dir / "clip", oldContent);
  std::error_code error = FileError::tooLarge;
  EXPECT_TRUE(removeFile(dir / "clip", error));
  EXPECT_FALSE(error);
  EXPECT_EQ(test::namesIn(dir.path()).size(), 0u);
}

TEST(RemoveFile, RemovesALinkAndNotWhatItLeadsTo) {
  const TempDir dir;
  test::putFile(dir / "clip", oldContent);
  fs::create_symlink("clip", dir / "link");
  std::error_code error;
  EXPECT_TRUE(removeFile(dir / "link", error));
  EXPECT_EQ(test::getFile(dir / "clip"), oldContent);
  EXPECT_EQ(test::namesIn(dir.path()).size(), 1u);
}

TEST(RemoveFile, SaysThatThereIsNone) {
  const TempDir dir;
  std::error_code error;
  EXPECT_FALSE(removeFile(dir / "clip", error));
  EXPECT_EQ(error, std::errc::no_such_file_or_directory);
}

TEST(RemoveFile, NeverRemovesAFolder) {
  const TempDir dir;
  fs::create_directory(dir / "clip");
  std::error_code error;
  EXPECT_FALSE(removeFile(dir / "clip", error));
  EXPECT_EQ(error, std::errc::is_a_directory);
  EXPECT_TRUE(fs::is_directory(dir / "clip"));
}

TEST(RemoveFile, RefusesANameWithANulInIt) {
  const TempDir dir;
  test::putFile(dir / "clip", oldContent);
  std::error_code error;
  EXPECT_FALSE(removeFile(dir / std::string("clip\0.colr", 10), error));
  EXPECT_EQ(error, std::errc::invalid_argument);
  EXPECT_EQ(test::getFile(dir / "clip"), oldContent);
}

TEST(ReplaceWholeFile, ReplacesWhatIsAsItWasRead) {
  const TempDir folder;
  test::putFile(folder / "clip", oldContent);
  ASSERT_EQ(::chmod((folder / "clip").c_str(), 0604), 0);
  fs::create_symlink("clip", folder / "link");
  std::error_code error;
  EXPECT_TRUE(replaceWholeFile(folder / "link", oldContent, newContent, error));
  EXPECT_EQ(test::getFile(folder / "clip"), newContent);
  EXPECT_EQ(modeOf(folder / "clip"), 0604u);
  EXPECT_TRUE(fs::is_symlink(folder / "link"));
  EXPECT_EQ(test::namesIn(folder.path()).size(), 2u);
}

TEST(ReplaceWholeFile, MakesAFileThatIsStillNotThere) {
  const TempDir folder;
  std::error_code error;
  EXPECT_TRUE(replaceWholeFile(folder / "clip", std::nullopt, newContent, error));
  EXPECT_EQ(test::getFile(folder / "clip"), newContent);
}

TEST(ReplaceWholeFile, LeavesWhatHasChangedMeanwhile) {
  const TempDir folder;
  const auto refuses = [&](const std::optional<Bytes>& read) {
    std::error_code error;
    return !replaceWholeFile(folder / "clip", read, newContent, error) &&
           error == FileError::changed && error.message() == "Changed since it was read";
  };
  EXPECT_TRUE(refuses(oldContent));  // gone
  EXPECT_EQ(test::namesIn(folder.path()).size(), 0u);
  test::putFile(folder / "clip", oldContent);
  EXPECT_TRUE(refuses(std::nullopt));  // come into being
  EXPECT_TRUE(refuses(Bytes{}));
  EXPECT_TRUE(refuses(Bytes{'o', 'l', 'd', 'e', 'r'}));
  EXPECT_TRUE(refuses(Bytes{'o', 'd', 'd'}));  // of the same size
  EXPECT_EQ(test::getFile(folder / "clip"), oldContent);
  EXPECT_EQ(test::namesIn(folder.path()).size(), 1u);
}

TEST(ReplaceWholeFile, TakesAFileOfTheSameContentForTheSame) {
  const TempDir folder;
  test::putFile(folder / "clip", oldContent);
  test::putFile(folder / "copy", oldContent);
  fs::rename(folder / "copy", folder / "clip");
  std::error_code error;
  EXPECT_TRUE(replaceWholeFile(folder / "clip", oldContent, newContent, error));
}

TEST(ReplaceWholeFile, LeavesAFileThatMayNotBeReadAnyMore) {
  const TempDir folder;
  fs::permissions(folder.path(), fs::perms::all);
  test::putFile(folder / "clip", oldContent);
  fs::permissions(folder / "clip", fs::perms::none);
  EXPECT_TRUE(asOrdinaryUser([&] {
    std::error_code error;
    return !replaceWholeFile(folder / "clip", std::nullopt, newContent, error) &&
           error == FileError::changed;
  }));
}

TEST(WriteNewFile, WritesWhereNothingIs) {
  const TempDir folder;
  std::error_code error = std::make_error_code(std::errc::io_error);
  EXPECT_TRUE(writeNewFile(folder / "clip", newContent, error));
  EXPECT_FALSE(error);
  EXPECT_EQ(test::getFile(folder / "clip"), newContent);
}

TEST(WriteNewFile, LeavesWhatIsThereAlone) {
  const TempDir folder;
  test::putFile(folder / "clip", oldContent);
  fs::create_directory(folder / "folder");
  fs::create_symlink("clip", folder / "link");
  fs::create_symlink("nowhere", folder / "nothing");
  fs::create_symlink("circle", folder / "circle");
  for (const char* name : {"clip", "folder", "link", "nothing", "circle"}) {
    std::error_code error;
    EXPECT_FALSE(writeNewFile(folder / name, newContent, error)) << name;
    EXPECT_EQ(error, std::errc::file_exists) << name;
  }
  EXPECT_EQ(test::getFile(folder / "clip"), oldContent);
  EXPECT_FALSE(fs::exists(folder / "nowhere"));
}

TEST(WriteNewFile, SaysWhyItCouldNot) {
  const TempDir folder;
  test::putFile(folder / "clip", oldContent);
  std::error_code error;
  EXPECT_FALSE(writeNewFile(folder / "missing/clip", newContent, error));
  EXPECT_EQ(error, std::errc::no_such_file_or_directory);
  EXPECT_FALSE(writeNewFile(folder / "clip/clip", newContent, error));
  EXPECT_EQ(error, std::errc::not_a_directory);
  EXPECT_FALSE(writeNewFile(folder / std::string("a\0b", 3), newContent, error));
  EXPECT_EQ(error, std::errc::invalid_argument);
}

// Runs a writer with memory for no allocation, for one and so on; answers how often it ran out.
template <class Writer>
std::size_t shortagesOf(const TempDir& folder, Writer write) {
  for (std::size_t granted = 0; granted < 100; ++granted) {
    test::putFile(folder / "clip", oldContent);
    const fs::path path = folder / "clip";
    bool isWritten = false;
    bool wasFelt = false;
    {
      const test::MemoryShortage shortage(granted);
      try {
        isWritten = write(path);
      } catch (const std::bad_alloc&) {
      }
      wasFelt = shortage.wasFelt();
    }
    EXPECT_EQ(test::getFile(path), isWritten ? newContent : oldContent) << granted;
    EXPECT_EQ(test::namesIn(folder.path()), std::set<std::string>{"clip"}) << granted;
    if (!wasFelt) return isWritten ? granted : 0;
  }
  return 0;
}

TEST(WriteWholeFile, WithoutMemoryLeavesTheOldFileAndNothingElse) {
  const TempDir folder;
  EXPECT_GT(shortagesOf(folder,
                        [](const fs::path& path) {
                          std::error_code error;
                          return writeWholeFile(path, newContent, error);
                        }),
            0u);
}

TEST(ReplaceWholeFile, WithoutMemoryLeavesTheOldFileAndNothingElse) {
  const TempDir folder;
  const std::optional<Bytes> old = oldContent;
  EXPECT_GT(shortagesOf(folder,
                        [&](const fs::path& path) {
                          std::error_code error;
                          return replaceWholeFile(path, old, newContent, error);
                        }),
            0u);
}

TEST(FileError, HasATextForEachCode) {
  const std::error_code error = FileError::tooLarge;
  EXPECT_STREQ(error.category().name(), "oxmv.file");
  EXPECT_NE(error.message(), error.category().message(99));
  EXPECT_EQ(error.category().message(99), "Unknown error");
}

}  // namespace
}  // namespace oxmv
