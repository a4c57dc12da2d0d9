#include <filesystem>

#include <gtest/gtest.h>

#include "oxmv/platform/WholeFile.h"
#include "oxmv/store/LastRecord.h"
#include "tests/support/Files.h"
#include "tests/support/Memory.h"
#include "tests/support/TempDir.h"
#include "tests/support/WideLong.h"

namespace oxmv::test {
namespace {

// The GUID in both builds: Data1 takes 8 bytes or 4, and only the longer form has padding.
const Bytes record = is64Bit ? Bytes{0x33, 0x22, 0x11, 0x00, 0x00, 0x00, 0x00, 0x00,  // Data1
                                     0x55, 0x44, 0x77, 0x66,  // Data2, Data3
                                     0x88, 0x99, 0xAA, 0xBB, 0xCC, 0xDD, 0xEE, 0xFF,  // Data4
                                     0xDE, 0xAD, 0xBE, 0xEF}                          // padding
                             : Bytes{0x33, 0x22, 0x11, 0x00,                          // Data1
                                     0x55, 0x44, 0x77, 0x66,  // Data2, Data3
                                     0x88, 0x99, 0xAA, 0xBB, 0xCC, 0xDD, 0xEE, 0xFF};  // Data4
constexpr myGUID guid = {
    0x00112233, 0x4455, 0x6677, {0x88, 0x99, 0xAA, 0xBB, 0xCC, 0xDD, 0xEE, 0xFF}};
const Bytes stream = {'T', 'A', 'K', 'E', 4, 0, 0, 'B', 3, 0, 0, 0};

Bytes operator+(Bytes a, const Bytes& b) {
  a.insert(a.end(), b.begin(), b.end());
  return a;
}

Bytes streamOf(const LastRecord& last) { return last.stream ? *last.stream : bytesOf("no stream"); }

TEST(LastRecord, IsAGuidAndAStream) {
  const TempDir dir;
  putFile(dir / "last", record + stream);
  std::error_code error = FileError::tooLarge;
  const LastRecord last = readLastRecord(dir / "last", error);
  EXPECT_FALSE(error);
  EXPECT_EQ(last.guid, guid);
  EXPECT_EQ(streamOf(last), stream);
  EXPECT_EQ(readLastGUID(dir / "last"), guid);
}

TEST(LastRecord, KeepsTheWidthOfTheBuild) {
  static_assert(sizeof(myGUID) == (is64Bit ? 24 : 16));
  EXPECT_EQ(record.size(), sizeof(myGUID));
}

TEST(LastRecord, OfTheGuidAloneHasAnEmptyStream) {
  const TempDir dir;
  putFile(dir / "last", record);
  std::error_code error;
  const LastRecord last = readLastRecord(dir / "last", error);
  EXPECT_EQ(last.guid, guid);
  EXPECT_EQ(streamOf(last), Bytes());
}

TEST(LastRecord, TooShortForItsGuidKeepsTheBytesThatAreThere) {
  const TempDir dir;
  for (std::size_t size = 0; size < record.size(); ++size) {
    const Bytes start(record.begin(), record.begin() + static_cast<std::ptrdiff_t>(size));
    putFile(dir / "last", start);
    myGUID expected;
    copyOverImage(expected, start);
    std::error_code error;
    const LastRecord last = readLastRecord(dir / "last", error);
    EXPECT_FALSE(error);
    EXPECT_EQ(last.guid, expected);
    EXPECT_EQ(last.guidSize, size);
    EXPECT_EQ(last.stream, std::nullopt) << size;
    EXPECT_EQ(readLastGUID(dir / "last"), expected);
  }
}

TEST(LastRecord, CutInTheMiddleHasZerosThere) {
  const TempDir dir;
  putFile(dir / "last", {0x33, 0x22});
  EXPECT_EQ(readLastGUID(dir / "last"), (myGUID{0x2233, 0, 0, {}}));
}

TEST(LastRecord, ThatIsMissingIsZero) {
  const TempDir dir;
  std::error_code error;
  const LastRecord last = readLastRecord(dir / "last", error);
  EXPECT_EQ(error, std::errc::no_such_file_or_directory);
  EXPECT_EQ(last.guid, myGUID());
  EXPECT_EQ(last.stream, std::nullopt);
  EXPECT_EQ(readLastGUID(dir / "last"), myGUID());
}

TEST(LastRecord, ThatIsAFolderIsZero) {
  const TempDir dir;
  std::filesystem::create_directory(dir / "last");
  std::error_code error;
  EXPECT_EQ(readLastRecord(dir / "last", error).guid, myGUID());
  EXPECT_EQ(error, std::errc::is_a_directory);
  EXPECT_EQ(readLastGUID(dir / "last"), myGUID());
}

TEST(LastRecord, TooLargeForMemoryKeepsItsGuid) {
  const TempDir dir;
  putFile(dir / "last", record + stream);
  std::filesystem::resize_file(dir / "last", std::uintmax_t{1} << 31);
  std::error_code error;
  const LastRecord last = readLastRecord(dir / "last", error);
  EXPECT_EQ(error, FileError::tooLarge);
  EXPECT_EQ(last.guid, guid);
  EXPECT_EQ(last.stream, std::nullopt);
  EXPECT_EQ(readLastGUID(dir / "last"), guid);
}

// Of every allocation; the GUID is read before most of them.
TEST(LastRecord, WithoutMemoryKeepsItsGuid) {
  const TempDir dir;
  putFile(dir / "last", record + stream);
  const std::string path = dir / "last";
  std::size_t guids = 0;
  for (std::size_t granted = 0;; ++granted) {
    ASSERT_LT(granted, 100u);
    std::error_code error;
    LastRecord last;
    bool wasFelt = false;
    {
      const MemoryShortage shortage(granted);
      last = readLastRecord(path, error);
      wasFelt = shortage.wasFelt();
    }
    if (!wasFelt) break;
    EXPECT_EQ(error, std::errc::not_enough_memory);
    EXPECT_EQ(last.stream, std::nullopt);
    EXPECT_TRUE(last.guid == guid || last.guid == myGUID());
    if (last.guid == guid) ++guids;
  }
  EXPECT_GT(guids, 0u);
}

TEST(LastRecord, KeepsCountingAsMissingUnderAPathThatIsNotAscii) {
  const TempDir dir;
  std::filesystem::create_directory(dir / "h\u00E9");
  putFile(dir / "h\u00E9" / "last", record + stream);
  std::error_code error;
  EXPECT_EQ(readLastRecord(dir / "h\u00E9" / "last", error).guid, myGUID());
  EXPECT_EQ(error, std::errc::no_such_file_or_directory);
  EXPECT_EQ(readLastGUID(dir / "h\u00E9" / "last"), myGUID());
}

}  // namespace
}  // namespace oxmv::test
