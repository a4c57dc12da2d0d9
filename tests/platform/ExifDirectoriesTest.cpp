#include <algorithm>
#include <string_view>

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

TEST_P(ExifDirectories, OtherEntriesGo) {
  const Bytes bytes = exif()
                          .make("KiVex")
                          .model("KV-QX301")
                          .entry(0xFFFE, Exif::longType, 1, offset(99))
                          .focalLength(15)
                          .exifEntry(0x829D, Exif::rationalType, 1, Bytes(8, 1))
                          .exifEntry(makerNote, Exif::undefinedType, 8, Bytes(8, 1))
                          .bytes();
  EXPECT_EQ(reducedExif(bytes), exif().model("KV-QX301").focalLength(15).bytes());
}

TEST_P(ExifDirectories, NoFurtherDirectoryIsReached) {
  const Bytes whole = exif().software("QX1").bytes();
  Bytes linked = whole;
  const std::size_t next = 6 + 8 + 2 + 12;
  ASSERT_EQ(linked.size(), next + 4);
  linked[next] = linked[next + 3] = 8;
  EXPECT_EQ(reducedExif(linked), whole);
}

TEST_P(ExifDirectories, WithoutLinksAreReadAllTheSame) {
  const auto of = [] { return exif().model("KV-QX301").software("QX3.01.02.00"); };
  EXPECT_EQ(reducedExif(of().withoutLinks().bytes()), of().bytes());
  const Bytes bytes = of().focalLength(15).withoutLinks().bytes();
  EXPECT_EQ(reducedExif(bytes), of().focalLength(15).bytes());
  EXPECT_EQ(readExif(bytes).software, "QX3.01.02.00");
  EXPECT_EQ(readExif(bytes).model, "KV-QX301");
  EXPECT_EQ(readExif(bytes).focalLength, 15);
}

TEST_P(ExifDirectories, ATextRightBehindTheLastEntryStays) {
  const auto of = [](std::uint32_t at) {
    return exif()
        .entry(Exif::softwareTag, Exif::asciiType, 13, offset(at))
        .focalLength(15)
        .withoutLinks()
        .bytes();
  };
  Bytes bytes = of(static_cast<std::uint32_t>(of(0).size() - 6));
  for (const char c : std::string_view("QX3.01.02.00\0", 13))
    bytes.push_back(static_cast<std::uint8_t>(c));
  EXPECT_EQ(readExif(bytes).software, "QX3.01.02.00");
  EXPECT_EQ(readExif(bytes).focalLength, 15);
}

TEST_P(ExifDirectories, ThatClaimMoreEntriesThanTheyHaveChangeNoValue) {
  const auto of = [] {
    return exif()
        .model("KV-QX301 of a long name")
        .software("QX3.01.02.00 and so on")
        .focalLength(15);
  };
  for (const int surplus : {1, 2, 3, 5, 100, 65532}) {
    const Bytes bytes = of().withSurplusCount(static_cast<std::uint16_t>(surplus)).bytes();
    EXPECT_EQ(reducedExif(bytes), of().bytes()) << surplus;
    EXPECT_EQ(readExif(bytes).software, "QX3.01.02.00 and so on") << surplus;
    EXPECT_EQ(readExif(bytes).model, "KV-QX301 of a long name") << surplus;
    EXPECT_EQ(readExif(bytes).focalLength, 15) << surplus;
  }
}

TEST_P(ExifDirectories, AValueOutsideIsNotThere) {
  const Bytes nothing = exif().bytes();
  const auto of = [](std::uint16_t type, std::uint32_t count, std::uint32_t at) {
    return exif().entry(Exif::softwareTag, type, count, offset(at)).bytes();
  };
  EXPECT_EQ(reducedExif(of(Exif::asciiType, 5, 22)), nothing);  // of 26 bytes in all
  EXPECT_NE(reducedExif(of(Exif::asciiType, 5, 21)), nothing);
  EXPECT_EQ(reducedExif(of(Exif::asciiType, 5, 0xFFFFFFFF)), nothing);
  EXPECT_EQ(reducedExif(of(Exif::asciiType, 0xFFFFFFFF, 8)), nothing);
  EXPECT_EQ(reducedExif(of(Exif::doubleType, 0x20000001, 8)), nothing);
  EXPECT_EQ(reducedExif(of(Exif::asciiType, 0, 8)), nothing);
  EXPECT_EQ(reducedExif(of(0, 1, 8)), nothing);
  EXPECT_EQ(reducedExif(of(13, 1, 8)), nothing);
}

TEST_P(ExifDirectories, ADirectoryOutsideIsNotThere) {
  EXPECT_EQ(reducedExif(exif().entry(exifPointer, Exif::longType, 1, offset(25)).bytes()),
            exif().bytes());
  Bytes bytes = exif().software("QX1").bytes();
  const Bytes far = offset(25);
  std::copy(far.begin(), far.end(), bytes.begin() + 6 + 4);
  EXPECT_EQ(reducedExif(bytes), exif().bytes());
}

TEST_P(ExifDirectories, OneThatNamesItselfIsReadOnce) {
  const Bytes bytes =
      exif().software("QX1").entry(exifPointer, Exif::longType, 1, offset(8)).bytes();
  EXPECT_EQ(reducedExif(bytes), exif().software("QX1").bytes());
}

// The second directory begins within the first one, whose last entry names it.
TEST_P(ExifDirectories, ThatOverlapAreBothRead) {
  for (std::uint32_t second = 8; second < 40; ++second) {
    const Bytes bytes =
        exif().software("QX1").entry(exifPointer, Exif::longType, 1, offset(second)).bytes();
    EXPECT_EQ(reducedExif(bytes), exif().software("QX1").bytes()) << second;
    EXPECT_EQ(readExif(bytes).software, "QX1") << second;
  }
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
  const std::size_t lastNeeded = whole.size() - 4;  // the last link is not
  for (std::size_t size = 6 + 8; size < whole.size(); ++size) {
    const Bytes bytes(whole.begin(), whole.begin() + static_cast<std::ptrdiff_t>(size));
    const auto reduced = reducedExif(bytes);
    ASSERT_TRUE(reduced);
    EXPECT_EQ(*reduced == whole, size >= lastNeeded) << size;
  }
}

// A billion ways down. A reader that takes them all is still at it when the tests are given up.
TEST_P(ExifDirectories, ThatNameEachOtherAThousandTimesEnd) {
  EXPECT_EQ(readExif(exifThatNamesDirectories(1000, GetParam())).focalLength, std::nullopt);
}

TEST_P(ExifDirectories, KeepTheFirstOfEachEntry) {
  const Bytes once = exif().software("one").focalLength(15).bytes();
  const Bytes twice =
      exif().software("one").software("two").focalLength(15).focalLength(16).bytes();
  EXPECT_EQ(reducedExif(twice), once);
}

TEST_P(ExifDirectories, KeepTheFirstThatIsThere) {
  Exif twice = exif();
  twice.entry(Exif::softwareTag, Exif::asciiType, 1000, offset(8)).software("two");
  twice.entry(exifPointer, Exif::longType, 1, offset(1000)).focalLength(16);
  EXPECT_EQ(reducedExif(twice.bytes()), exif().software("two").focalLength(16).bytes());
}

}  // namespace
}  // namespace oxmv::test
