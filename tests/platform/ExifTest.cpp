#include <bit>
#include <limits>
#include <string_view>

#include <gtest/gtest.h>

#include "oxmv/platform/Exif.h"
#include "tests/support/StillBuilder.h"

namespace oxmv::test {
namespace {

using namespace std::string_view_literals;
using Exif = ExifBuilder;

ExifProperties read(const Exif& exif) {
  const Bytes bytes = exif.bytes();  // exactly its size: a sanitizer sees what is read beyond
  return readExif(bytes);
}

class ExifOfEitherOrder : public testing::TestWithParam<ByteOrder> {
 protected:
  static Exif exif() { return Exif(GetParam()); }
  static std::optional<double> focalLength(std::uint16_t type, std::uint32_t count,
                                           const std::vector<std::uint32_t>& words,
                                           std::size_t width) {
    Exif built = exif();
    return read(built.exifEntry(Exif::focalLengthTag, type, count, built.words(words, width)))
        .focalLength;
  }
};

INSTANTIATE_TEST_SUITE_P(, ExifOfEitherOrder, testing::Values(ByteOrder::little, ByteOrder::big),
                         [](const auto& order) {
                           return order.param == ByteOrder::little ? "Little" : "Big";
                         });

TEST_P(ExifOfEitherOrder, ThreePropertiesAreRead) {
  const auto properties =
      read(exif().make("KiVex").model("KV-QX301").software("QX3.01.02.00").focalLength(15));
  EXPECT_EQ(properties.focalLength, 15);
  EXPECT_EQ(properties.software, "QX3.01.02.00");
  EXPECT_EQ(properties.model, "KV-QX301");
}

TEST_P(ExifOfEitherOrder, WhatIsNotThereIsNotRead) {
  const auto nothing = read(exif());
  EXPECT_EQ(nothing.focalLength, std::nullopt);
  EXPECT_EQ(nothing.software, std::nullopt);
  EXPECT_EQ(nothing.model, std::nullopt);
  EXPECT_EQ(read(exif().focalLength(20)).software, std::nullopt);
  EXPECT_EQ(read(exif().software("QX")).focalLength, std::nullopt);
  EXPECT_EQ(read(exif().software("QX")).model, std::nullopt);
}

// Four bytes stand in the entry itself, more behind the directory.
TEST_P(ExifOfEitherOrder, TextsOfAnyLengthAreRead) {
  for (const auto text : {"Q"sv, "QX1"sv, "QX1."sv, "QX1.0"sv}) {
    EXPECT_EQ(read(exif().software(text)).software, text);
  }
  const std::string longOne(60000, 'x');
  EXPECT_EQ(read(exif().model(longOne)).model, longOne);
}

TEST_P(ExifOfEitherOrder, AnyTypeOfNumberIsAFocalLength) {
  EXPECT_EQ(focalLength(Exif::byteType, 1, {200}, 1), 200);
  EXPECT_EQ(focalLength(Exif::shortType, 1, {65535}, 2), 65535);
  EXPECT_EQ(focalLength(Exif::longType, 1, {4294967295}, 4), 4294967295.0);
  EXPECT_EQ(focalLength(Exif::rationalType, 1, {31, 2}, 4), 15.5);
  EXPECT_EQ(focalLength(6, 1, {0xFF}, 1), -1);
  EXPECT_EQ(focalLength(Exif::signedShortType, 1, {0xFFFF}, 2), -1);
  EXPECT_EQ(focalLength(Exif::signedLongType, 1, {0xFFFFFFFF}, 4), -1);
  EXPECT_EQ(focalLength(Exif::signedRationalType, 1, {0xFFFFFFFF, 2}, 4), -0.5);
  EXPECT_EQ(focalLength(Exif::floatType, 1, {std::bit_cast<std::uint32_t>(24.5f)}, 4), 24.5);
  const auto bits = std::bit_cast<std::uint64_t>(24.1);
  std::vector<std::uint32_t> words = {static_cast<std::uint32_t>(bits >> 32),
                                      static_cast<std::uint32_t>(bits)};
  if (GetParam() == ByteOrder::little) std::swap(words[0], words[1]);
  EXPECT_EQ(focalLength(Exif::doubleType, 1, words, 4), 24.1);
}

TEST_P(ExifOfEitherOrder, WhatIsNoNumberIsNoFocalLength) {
  EXPECT_EQ(focalLength(Exif::asciiType, 1, {'1'}, 1), std::nullopt);
  EXPECT_EQ(focalLength(Exif::undefinedType, 1, {1}, 1), std::nullopt);
  EXPECT_EQ(focalLength(Exif::rationalType, 1, {1, 0}, 4), std::nullopt);
  EXPECT_EQ(focalLength(Exif::signedRationalType, 1, {1, 0}, 4), std::nullopt);
  EXPECT_EQ(focalLength(0, 1, {1}, 2), std::nullopt);
  EXPECT_EQ(focalLength(13, 1, {1}, 4), std::nullopt);
  EXPECT_EQ(focalLength(0xFFFF, 1, {1}, 4), std::nullopt);
}

TEST_P(ExifOfEitherOrder, NoneOrSeveralNumbersAreNoFocalLength) {
  EXPECT_EQ(focalLength(Exif::shortType, 0, {15}, 2), std::nullopt);
  EXPECT_EQ(focalLength(Exif::shortType, 2, {15, 15}, 2), std::nullopt);
  EXPECT_EQ(focalLength(Exif::shortType, 0x80000001, {15}, 2), std::nullopt);
  EXPECT_EQ(focalLength(Exif::rationalType, 0x20000001, {15, 1}, 4), std::nullopt);
}

TEST_P(ExifOfEitherOrder, TheFirstOfTwoEntriesCounts) {
  EXPECT_EQ(read(exif().software("one").software("two")).software, "one");
}

TEST_P(ExifOfEitherOrder, ATextOfAnotherTypeIsNone) {
  for (const auto type : {Exif::byteType, Exif::shortType, Exif::undefinedType}) {
    EXPECT_EQ(read(exif().entry(Exif::softwareTag, type, 8, Bytes(16, 'x'))).software,
              std::nullopt);
  }
}

TEST_P(ExifOfEitherOrder, ATextEndsAtItsFirstNulOrWithItsBytes) {
  const auto software = [](std::string_view bytes) {
    return read(exif().entry(Exif::softwareTag, Exif::asciiType,
                             static_cast<std::uint32_t>(bytes.size()), bytesOf(bytes)))
        .software;
  };
  EXPECT_EQ(software("QX1.02\0more\0"sv), "QX1.02");
  EXPECT_EQ(software("QX1.02"), "QX1.02");
  EXPECT_EQ(software("  QX1 \n"), "  QX1 \n");
  EXPECT_EQ(software("\0"sv), "");
  EXPECT_EQ(software("\0\0\0\0\0\0"sv), "");
}

// A text of no bytes has not even its NUL.
TEST_P(ExifOfEitherOrder, ATextOfNoBytesIsNone) {
  EXPECT_EQ(read(exif().entry(Exif::softwareTag, Exif::asciiType, 0, {})).software, std::nullopt);
}

TEST_P(ExifOfEitherOrder, TextThatIsNotUtf8IsTakenAsLatin1) {
  EXPECT_EQ(read(exif().software("QX1 \xC3\xA9")).software, "QX1 \xC3\xA9");
  EXPECT_EQ(read(exif().software("QX1 \xE9")).software, "QX1 \xC3\xA9");
}

TEST_P(ExifOfEitherOrder, ValuesBeyondTheSegmentAreNotThere) {
  Exif built = exif();
  built.entry(Exif::softwareTag, Exif::asciiType, 1000, built.words({8}, 4));
  built.entry(Exif::modelTag, Exif::asciiType, 0xFFFFFFFF, built.words({0xFFFFFFF0}, 4));
  EXPECT_EQ(read(built).software, std::nullopt);
  EXPECT_EQ(read(built).model, std::nullopt);
}

TEST_P(ExifOfEitherOrder, EveryShorterSegmentIsReadWithinIt) {
  const Bytes whole = exif().model("KV-QX301").software("QX3.01.02.00").focalLength(15).bytes();
  for (std::size_t size = 0; size < whole.size(); ++size) {
    const Bytes bytes(whole.begin(), whole.begin() + static_cast<std::ptrdiff_t>(size));
    const auto properties = readExif(bytes);
    EXPECT_TRUE(!properties.software || properties.software == "QX3.01.02.00") << size;
    EXPECT_TRUE(!properties.focalLength || properties.focalLength == 15) << size;
  }
}

// A directory that names itself as the one for EXIF, and one that is its own successor.
TEST_P(ExifOfEitherOrder, DirectoriesThatGoRoundInCirclesEnd) {
  Exif built = exif();
  built.entry(0x8769, Exif::longType, 1, built.words({8}, 4)).software("QX1.02");
  EXPECT_EQ(read(built).software, "QX1.02");
  Bytes bytes = exif().software("QX1").bytes();
  const Bytes next = exif().words({8}, 4);
  std::copy(next.begin(), next.end(), bytes.begin() + 6 + 8 + 2 + 12);
  EXPECT_EQ(readExif(bytes).software, "QX1");
}

TEST(Exif, OtherBytesHaveNoProperties) {
  for (const auto bytes : {""sv, "Exif\0\0"sv, "Exif\0\0II"sv, "Exif\0\0XX*\0\x08\0\0\0"sv,
                           "Exif\0\0II+\0\x08\0\0\0\0\0"sv, "Exif\0\0II*\0\xFF\xFF\xFF\xFF\0\0"sv,
                           "http://example.org/"sv}) {
    const auto properties = readExif(bytesOf(bytes));
    EXPECT_EQ(properties.focalLength, std::nullopt);
    EXPECT_EQ(properties.software, std::nullopt);
    EXPECT_EQ(properties.model, std::nullopt);
  }
}

}  // namespace
}  // namespace oxmv::test
