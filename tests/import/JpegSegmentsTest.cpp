#include <string>
#include <string_view>

#include <gtest/gtest.h>

#include "oxmv/import/JpegSegments.h"
#include "tests/support/StillBuilder.h"

namespace oxmv::test {
namespace {

using namespace std::literals;

std::string exifOf(std::string_view jpeg) {
  const Bytes bytes = bytesOf(jpeg);  // exactly its size: a sanitizer sees what is read beyond
  const auto content = exifSegment(bytes);
  return {content.begin(), content.end()};
}

TEST(JpegSegments, ExifIsTheContentOfItsSegment) {
  EXPECT_EQ(exifOf("\xFF\xD8\xFF\xE1\0\x0ATabc\0\0\xFF\xDA"sv), "");
  EXPECT_EQ(exifOf("\xFF\xD8\xFF\xE1\0\x0A"
                   "Exif\0\0ab\xFF\xDA"sv),
            "Exif\0\0ab"sv);
}

TEST(JpegSegments, TheFirstExifCounts) {
  EXPECT_EQ(exifOf("\xFF\xD8\xFF\xE0\0\4ab\xFF\xE1\0\4ab\xFF\xE1\0\x09"
                   "Exif\0\0"
                   "1\xFF\xE1\0\x09"
                   "Exif\0\0"
                   "2"sv),
            "Exif\0\0"
            "1"sv);
}

TEST(JpegSegments, FillBytesRestartsAndStrayBytesAreSteppedOver) {
  EXPECT_EQ(exifOf("\xFF\xD8"
                   "stray\xFF\0\xFF\xD3\xFF\1\xFF\xFF\xFF\xE1\0\x08"
                   "Exif\0\0"sv),
            "Exif\0\0"sv);
}

TEST(JpegSegments, ExifInAnotherSegmentIsNone) {
  EXPECT_EQ(exifOf("\xFF\xD8\xFF\xE2\0\x08"
                   "Exif\0\0"sv),
            "");
}

TEST(JpegSegments, NothingCountsBehindTheFirstScanOrTheEnd) {
  for (const auto last : {"\xDA"sv, "\xD9"sv}) {
    EXPECT_EQ(exifOf("\xFF\xD8\xFF" + std::string(last) +
                     "\0\2\xFF\xE1\0\x08"
                     "Exif\0\0"s),
              "");
  }
}

TEST(JpegSegments, ASegmentThatIsNotWholeEndsTheSearch) {
  constexpr auto whole =
      "\xFF\xD8\xFF\xE0\0\4ab\xFF\xE1\0\x0A"
      "Exif\0\0ab"sv;
  EXPECT_EQ(exifOf(whole), "Exif\0\0ab"sv);
  for (std::size_t size = 0; size < whole.size(); ++size) {
    EXPECT_EQ(exifOf(whole.substr(0, size)), "") << size;
  }
}

TEST(JpegSegments, ASizeThatDoesNotCountItselfEndsTheSearch) {
  for (const auto size : {"\0\0"sv, "\0\1"sv}) {
    EXPECT_EQ(exifOf("\xFF\xD8\xFF\xE0" + std::string(size) +
                     "\xFF\xE1\0\x08"
                     "Exif\0\0"s),
              "");
  }
}

}  // namespace
}  // namespace oxmv::test
