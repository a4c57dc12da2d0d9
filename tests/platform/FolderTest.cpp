#include <filesystem>
#include <map>
#include <string>
#include <system_error>
#include <vector>

#include <gtest/gtest.h>
#include <sys/stat.h>

#include "oxmv/platform/Folder.h"
#include "oxmv/platform/WholeFile.h"
#include "tests/support/Files.h"
#include "tests/support/LeasedFile.h"
#include "tests/support/TempDir.h"

namespace oxmv {
namespace {

namespace fs = std::filesystem;
using test::Bytes;
using test::TempDir;

// A folder of one test's own, open.
class OpenFolder : public testing::Test {
 protected:
  Folder open() const {
    std::error_code cause;
    return Folder::open(root.path(), cause).value();
  }

  // No bytes and an error when it cannot be read.
  Bytes read(const std::string& name, EntryKind kind = EntryKind::regular) {
    const auto content = open().read(name, kind, buffer, error);
    EXPECT_EQ(content.has_value(), !error);
    return content ? Bytes(content->begin(), content->end()) : Bytes();
  }

  TempDir root;
  std::vector<std::uint8_t> buffer;
  std::error_code error;
};

TEST_F(OpenFolder, GivesItsEntriesWithTheirKinds) {
  test::putFile(root / "file", {1});
  fs::create_directory(root / "folder");
  fs::create_symlink("file", root / "link");
  ASSERT_EQ(::mkfifo((root / "pipe").c_str(), 0600), 0);
  const Folder folder = open();
  for (int i = 0; i < 2; ++i) {  // from the start each time
    std::map<std::string, EntryKind> entries;
    EXPECT_TRUE(folder.forEachEntry(
        [&](std::string_view name, EntryKind kind) { entries.emplace(name, kind); }, error));
    EXPECT_EQ(entries, (std::map<std::string, EntryKind>{{"file", EntryKind::regular},
                                                         {"folder", EntryKind::folder},
                                                         {"link", EntryKind::unknown},
                                                         {"pipe", EntryKind::other}}));
  }
  EXPECT_FALSE(error);
}

TEST_F(OpenFolder, GivesNoEntriesOfAnEmptyFolder) {
  std::size_t count = 0;
  EXPECT_TRUE(open().forEachEntry([&](std::string_view, EntryKind) { ++count; }, error));
  EXPECT_EQ(count, 0u);
}

TEST_F(OpenFolder, GivesThousandsOfEntriesEachOnce) {
  for (int i = 0; i < 3000; ++i) test::putFile(root / std::to_string(i), {});
  std::map<std::string, int> counts;
  EXPECT_TRUE(open().forEachEntry(
      [&](std::string_view name, EntryKind) { ++counts[std::string(name)]; }, error));
  EXPECT_EQ(counts.size(), 3000u);
  for (const auto& [name, count] : counts) EXPECT_EQ(count, 1) << name;
}

TEST_F(OpenFolder, IsNoneWhereThereIsNoFolder) {
  test::putFile(root / "file", {1});
  EXPECT_FALSE(Folder::open(root / "missing", error));
  EXPECT_EQ(error, std::errc::no_such_file_or_directory);
  EXPECT_FALSE(Folder::open(root / "file", error));
  EXPECT_EQ(error, std::errc::not_a_directory);
  EXPECT_FALSE(Folder::open(root.path().string() + std::string("\0x", 2), error));
  EXPECT_EQ(error, std::errc::invalid_argument);
}

TEST_F(OpenFolder, ReadsFilesOneAfterTheOther) {
  test::putFile(root / "long", {1, 2, 3, 4, 5});
  test::putFile(root / "short", {9});
  test::putFile(root / "empty", {});
  EXPECT_EQ(read("long"), (Bytes{1, 2, 3, 4, 5}));
  EXPECT_EQ(read("short"), Bytes{9});
  EXPECT_EQ(read("empty"), Bytes());
  EXPECT_FALSE(error);
}

TEST_F(OpenFolder, ReadsFilesOfAnySize) {
  for (const std::size_t size : {65535u, 65536u, 65537u, 300000u}) {
    Bytes content(size);
    for (std::size_t i = 0; i < size; ++i) content[i] = static_cast<std::uint8_t>(i % 251);
    test::putFile(root / "file", content);
    EXPECT_EQ(read("file"), content) << size;
  }
}

TEST_F(OpenFolder, FollowsLinksToRegularFilesOnly) {
  test::putFile(root / "file", {7});
  fs::create_symlink("file", root / "link");
  fs::create_symlink(".", root / "to-folder");
  ASSERT_EQ(::mkfifo((root / "pipe").c_str(), 0600), 0);
  fs::create_symlink("pipe", root / "to-pipe");
  EXPECT_EQ(read("link", EntryKind::unknown), Bytes{7});
  read("to-folder", EntryKind::unknown);
  EXPECT_EQ(error, std::errc::is_a_directory);
  read("to-pipe", EntryKind::unknown);
  EXPECT_EQ(error, FileError::notRegular);
  read("pipe", EntryKind::other);
  EXPECT_EQ(error, FileError::notRegular);
}

TEST_F(OpenFolder, FindsOutWhatHasTakenThePlaceOfAFile) {
  ASSERT_EQ(::mkfifo((root / "pipe").c_str(), 0600), 0);
  fs::create_directory(root / "folder");
  read("pipe", EntryKind::regular);  // does not wait for a writer
  EXPECT_EQ(error, FileError::notRegular);
  read("folder", EntryKind::regular);
  EXPECT_EQ(error, std::errc::is_a_directory);
  read("gone", EntryKind::regular);
  EXPECT_EQ(error, std::errc::no_such_file_or_directory);
}

TEST_F(OpenFolder, WaitsForAFileThatAnotherProcessHasForItself) {
  test::putFile(root / "clip", {1, 2, 3});
  const test::LeasedFile lease(root / "clip");
  if (!lease.isHeld()) GTEST_SKIP() << "no leases here";
  EXPECT_EQ(read("clip"), (Bytes{1, 2, 3}));
}

TEST_F(OpenFolder, RefusesFilesThatAreTooLarge) {
  test::putFile(root / "large", {1});
  fs::resize_file(root / "large", maxFileSize + 1);
  read("large");
  EXPECT_EQ(error, FileError::tooLarge);
  EXPECT_LE(buffer.size(), std::size_t{1} << 20);  // found out before it is read
}

TEST_F(OpenFolder, ReadsAgainAfterAFailure) {
  test::putFile(root / "file", {7});
  read("missing");
  EXPECT_TRUE(error);
  EXPECT_EQ(read("file"), Bytes{7});
}

}  // namespace
}  // namespace oxmv
