#include <gtest/gtest.h>

#include "oxmv/platform/Exif.h"
#include "oxmv/platform/ExifDirectories.h"
#include "tests/support/StillBuilder.h"

namespace oxmv::test {
namespace {

using Exif = ExifBuilder;

constexpr std::uint16_t exifPointer = 0x8769;
constexpr std::uint16_t makerNote = 0x927C;

class ExifDirectories : public testing::TestWithParam<ByteOrder> {
 protected:
  static Exif exif() { return Exif(GetParam()); }
  static Bytes offset(std::uint32_t at) { return exif().words({at}, 4); }
};

INSTANTIATE_TEST_SUITE_P(, ExifDirectories, testing::Values(ByteOrder::little, ByteOrder::big),
                         [](const auto& order) {
                           return order.param == ByteOrder::little ? "Little" : "Big";
                         });

TEST_P(ExifDirectories, WhatIsReadStays) {
  const Bytes bytes = exif().model("KV-QX301").software("QX3.01").focalLength(15).bytes();
  EXPECT_EQ(reducedExif(bytes), bytes);
}

TEST_P(ExifDirectories, OtherEntriesGetATagThatNobodyKnows) {
  // Of both directories; the other tags sort behind those that stay, so all keep their places.
  const auto of = [&](std::uint16_t tag) {
    return exif()
        .model("KV-QX301")
        .entry(tag, Exif::longType, 1, offset(99))
        .focalLength(15)
        .exifEntry(tag, Exif::shortType, 1, {1, 2})
        .bytes();
  };
  EXPECT_EQ(reducedExif(of(0xFFFE)), of(0xFFFF));
}

TEST_P(ExifDirectories, NoFurtherDirectoryIsReached) {
  const Bytes whole = exif().software("QX1").bytes();
  Bytes linked = whole;
  const std::size_t next = 6 + 8 + 2 + 12;
  ASSERT_EQ(linked.size(), next + 4);
  linked[next] = linked[next + 3] = 8;
  EXPECT_EQ(reducedExif(linked), whole);
}

TEST_P(ExifDirectories, OfTwoDirectoriesForExifTheFirstStays) {
  const Bytes bytes = exif()
                          .entry(exifPointer, Exif::longType, 1, offset(1000))
                          .entry(exifPointer, Exif::longType, 1, offset(2000))
                          .bytes();
  Bytes expected = bytes;
  expected[6 + 8 + 2 + 12] = expected[6 + 8 + 2 + 13] = 0xFF;
  EXPECT_EQ(reducedExif(bytes), expected);
}

TEST_P(ExifDirectories, OneThatNamesItselfIsNotReadTwice) {
  const Bytes bytes =
      exif().software("QX1").entry(exifPointer, Exif::longType, 1, offset(8)).bytes();
  const auto reduced = reducedExif(bytes);
  ASSERT_TRUE(reduced);
  EXPECT_EQ(readExif(bytes).software, "QX1");
  EXPECT_NE(*reduced, bytes);
}

// The second directory begins with the last byte of the first one's first entry, so that its first
// tag shares a byte with the one that names it: taken out there, it is damaged here.
TEST_P(ExifDirectories, ThatSpoilEachOtherAreNone) {
  const auto of = [](std::uint32_t second) {
    return exif().software("QX1").entry(exifPointer, Exif::longType, 1, offset(second)).bytes();
  };
  EXPECT_TRUE(reducedExif(of(38)));
  EXPECT_EQ(reducedExif(of(21)), std::nullopt);
  EXPECT_EQ(readExif(of(21)).software, std::nullopt);
}

TEST_P(ExifDirectories, WhatIsNoSegmentIsNone) {
  EXPECT_EQ(reducedExif({}), std::nullopt);
  const Bytes whole = exif().bytes();
  for (std::size_t size = 0; size < 6 + 8; ++size)
    EXPECT_EQ(reducedExif(Bytes(whole.begin(), whole.begin() + static_cast<std::ptrdiff_t>(size))),
              std::nullopt);
  Bytes other = whole;
  other[6] = 'X';
  EXPECT_EQ(reducedExif(other), std::nullopt);
}

TEST_P(ExifDirectories, EveryShorterSegmentIsReadWithinIt) {
  const Bytes whole = exif().model("KV-QX301").software("QX3.01").focalLength(15).bytes();
  for (std::size_t size = 6 + 8; size < whole.size(); ++size) {
    const Bytes bytes(whole.begin(), whole.begin() + static_cast<std::ptrdiff_t>(size));
    EXPECT_EQ(reducedExif(bytes), bytes) << size;
  }
}

// A billion ways down. A reader that takes them all is still at it when the tests are given up.
TEST_P(ExifDirectories, ThatNameEachOtherAThousandTimesEnd) {
  EXPECT_EQ(readExif(exifThatNamesDirectories(1000, GetParam())).focalLength, std::nullopt);
}

// Whose entries may all claim the same bytes, once for each.
TEST_P(ExifDirectories, LoseTheMakersNote) {
  const auto of = [](std::uint16_t tag) {
    return exif().exifEntry(tag, Exif::undefinedType, 8, Bytes(8, 1)).bytes();
  };
  EXPECT_EQ(reducedExif(of(makerNote)), of(0xFFFF));
}

TEST_P(ExifDirectories, KeepTheFirstOfEachEntry) {
  const Bytes once = exif().software("one").focalLength(15).bytes();
  const Bytes twice =
      exif().software("one").software("two").focalLength(15).focalLength(16).bytes();
  EXPECT_EQ(reducedExif(once), once);
  const auto reduced = reducedExif(twice);
  ASSERT_TRUE(reduced);
  Bytes expected = twice;
  const std::size_t secondText = 6 + 8 + 2 + 12;
  expected[secondText] = expected[secondText + 1] = 0xFF;
  const std::size_t secondNumber = expected.size() - 4 - 12;
  expected[secondNumber] = expected[secondNumber + 1] = 0xFF;
  EXPECT_EQ(*reduced, expected);
}

}  // namespace
}  // namespace oxmv::test
