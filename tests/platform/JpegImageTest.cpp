#include <algorithm>

#include <gtest/gtest.h>

#include "oxmv/platform/JpegImage.h"
#include "tests/support/StillBuilder.h"

namespace oxmv::test {
namespace {

std::size_t startOfScan(const Bytes& jpeg) {
  const Bytes marker = {0xFF, 0xDA};
  return static_cast<std::size_t>(
      std::search(jpeg.begin(), jpeg.end(), marker.begin(), marker.end()) - jpeg.begin());
}

TEST(JpegImage, APictureIsOne) {
  EXPECT_TRUE(isJpegImage(picture()));
  EXPECT_TRUE(isJpegImage(exampleStill()));
}

TEST(JpegImage, OtherBytesAreNone) {
  EXPECT_FALSE(isJpegImage({}));
  EXPECT_FALSE(isJpegImage(bytesOf("not a picture")));
  EXPECT_FALSE(isJpegImage(bytesOf("\x89PNG\r\n\x1A\n")));
  EXPECT_FALSE(isJpegImage(Bytes{0xFF, 0xD8}));
  EXPECT_FALSE(isJpegImage(Bytes{0xFF, 0xD8, 0xFF, 0xD9}));
}

TEST(JpegImage, TablesWithoutAPictureAreNone) {
  Bytes bytes = picture();
  bytes.resize(2 + 69);  // the first table
  bytes.insert(bytes.end(), {0xFF, 0xD9});
  EXPECT_FALSE(isJpegImage(bytes));
}

TEST(JpegImage, HeadersThatAreCutAreNone) {
  const Bytes whole = picture();
  const std::size_t scan = startOfScan(whole);
  for (std::size_t size = 0; size <= scan; ++size) {
    const Bytes bytes(whole.begin(), whole.begin() + static_cast<std::ptrdiff_t>(size));
    EXPECT_FALSE(isJpegImage(bytes)) << size;
  }
}

// Of three components, one with three times as many columns and one with twice as many rows as the
// others: the library has no name for it, but decodes it.
TEST(JpegImage, UnusualSamplingIsOneAllTheSame) {
  Bytes bytes = picture();
  const auto replaceSegment = [&](const Bytes& segment) {
    const auto at = std::search(bytes.begin(), bytes.end(), segment.begin(), segment.begin() + 2);
    ASSERT_NE(at, bytes.end());
    const auto end = at + 2 + (at[2] << 8 | at[3]);
    bytes.insert(bytes.erase(at, end), segment.begin(), segment.end());
  };
  replaceSegment({0xFF, 0xC0, 0, 17, 8, 0, 48, 0, 64, 3, 1, 0x31, 0, 2, 0x11, 0, 3, 0x12, 0});
  replaceSegment({0xFF, 0xDA, 0, 12, 3, 1, 0, 2, 0, 3, 0, 0, 63, 0});
  EXPECT_TRUE(isJpegImage(bytes));
}

// The pixels are nobody's business here.
TEST(JpegImage, PixelsThatAreCutDoNotMatter) {
  Bytes bytes = picture();
  bytes.resize(startOfScan(bytes) + 10);
  EXPECT_TRUE(isJpegImage(bytes));
}

TEST(JpegImage, ItsSizeIsFrom1To65500PixelsASide) {
  EXPECT_TRUE(isJpegImage(pictureThatClaims(1, 1)));
  EXPECT_TRUE(isJpegImage(pictureThatClaims(65500, 65500)));
  EXPECT_FALSE(isJpegImage(pictureThatClaims(65535, 65535)));
  EXPECT_FALSE(isJpegImage(pictureThatClaims(65501, 1)));
  EXPECT_FALSE(isJpegImage(pictureThatClaims(0, 48)));
  EXPECT_FALSE(isJpegImage(pictureThatClaims(64, 0)));
}

TEST(JpegImage, UnsupportedFramesAreNone) {
  const Bytes whole = picture();
  const Bytes frame = {0xFF, 0xC0};
  const auto at = std::search(whole.begin(), whole.end(), frame.begin(), frame.end());
  ASSERT_NE(at, whole.end());
  const auto place = static_cast<std::size_t>(at - whole.begin());
  Bytes lossless = whole;
  lossless[place + 1] = 0xC3;
  EXPECT_FALSE(isJpegImage(lossless));
  Bytes precise = whole;
  precise[place + 4] = 12;  // bits a pixel
  EXPECT_FALSE(isJpegImage(precise));
}

}  // namespace
}  // namespace oxmv::test
