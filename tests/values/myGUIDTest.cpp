#include <numeric>
#include <optional>
#include <span>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "oxmv/values/myGUID.h"
#include "tests/support/Printing.h"
#include "tests/support/WideLong.h"

namespace oxmv::test {
namespace {

static_assert(sizeof(myGUID) == sizeof(unsigned long) * 2 + 8,
              "24 bytes where unsigned long has 8, 16 where it has 4");

// 0x01, 0x02, ... so that every byte tells its place.
std::vector<std::uint8_t> image(std::size_t size) {
  std::vector<std::uint8_t> bytes(size);
  std::iota(bytes.begin(), bytes.end(), std::uint8_t{1});
  return bytes;
}

TEST(myGUID, IsZeroByDefault) {
  const myGUID guid;
  EXPECT_EQ(guid.Data1, 0u);
  EXPECT_EQ(guid.Data2, 0u);
  EXPECT_EQ(guid.Data3, 0u);
  EXPECT_EQ(guid.Data4, (std::array<std::uint8_t, 8>{}));
}

TEST(myGUID, TakesItsFieldsFromALittleEndianImage) {
  if (!is64Bit) GTEST_SKIP();
  myGUID guid;
  copyOverImage(guid, image(24));
  EXPECT_EQ(guid, (myGUID{wide(0x0807060504030201u),
                          0x0A09,
                          0x0C0B,
                          {0x0D, 0x0E, 0x0F, 0x10, 0x11, 0x12, 0x13, 0x14}}));
}

TEST(myGUID, ImageOfA32BitBuildIsShorter) {
  if (is64Bit) GTEST_SKIP();
  const myGUID whole{0x04030201, 0x0605, 0x0807, {0x09, 0x0A, 0x0B, 0x0C, 0x0D, 0x0E, 0x0F, 0x10}};
  for (const std::size_t size : {16u, 17u, 24u}) {
    myGUID guid;
    copyOverImage(guid, image(size));
    EXPECT_EQ(guid, whole) << size;
  }
  myGUID guid;
  copyOverImage(guid, image(5));
  EXPECT_EQ(guid, (myGUID{0x04030201, 0x0005, 0, {}}));
}

TEST(myGUID, ShortImageLeavesTheRest) {
  if (!is64Bit) GTEST_SKIP();
  const myGUID before{
      wide(0xAAAAAAAAAAAAAAAAu), 0xBBBB, 0xCCCC, {0xD0, 0xD1, 0xD2, 0xD3, 0xD4, 0xD5, 0xD6, 0xD7}};
  const auto after = [&](std::size_t size) {
    myGUID guid = before;
    copyOverImage(guid, image(size));
    return guid;
  };
  EXPECT_EQ(after(0), before);

  myGUID expected = before;
  expected.Data1 = wide(0xAAAAAAAAAAAAAA01u);
  EXPECT_EQ(after(1), expected);
  expected.Data1 = wide(0xAA07060504030201u);
  EXPECT_EQ(after(7), expected);
  expected.Data1 = wide(0x0807060504030201u);
  EXPECT_EQ(after(8), expected);
  expected.Data2 = 0xBB09;
  EXPECT_EQ(after(9), expected);
  expected.Data2 = 0x0A09;
  expected.Data3 = 0xCC0B;
  EXPECT_EQ(after(11), expected);
  expected.Data3 = 0x0C0B;
  EXPECT_EQ(after(12), expected);
  expected.Data4 = {0x0D, 0x0E, 0x0F, 0x10, 0xD4, 0xD5, 0xD6, 0xD7};
  EXPECT_EQ(after(16), expected);
}

TEST(myGUID, PaddingAndWhatFollowsIsInNoField) {
  if (!is64Bit) GTEST_SKIP();
  myGUID of20;
  copyOverImage(of20, image(20));
  for (const std::size_t size : {21u, 24u, 25u, 100u}) {
    myGUID guid;
    copyOverImage(guid, image(size));
    EXPECT_EQ(guid, of20) << size;
  }
}

TEST(myGUID, DiffersByEveryField) {
  const myGUID guid{1, 2, 3, {4}};
  EXPECT_EQ(guid, (myGUID{1, 2, 3, {4}}));
  EXPECT_FALSE(guid == (myGUID{0, 2, 3, {4}}));
  EXPECT_FALSE(guid == (myGUID{1, 0, 3, {4}}));
  EXPECT_FALSE(guid == (myGUID{1, 2, 0, {4}}));
  EXPECT_FALSE(guid == (myGUID{1, 2, 3, {4, 0, 0, 0, 0, 0, 0, 1}}));
}

TEST(myGUID, TextIsUpperCaseIn8And4And4And4And12Digits) {
  EXPECT_EQ(
      guidText({0x0A1B2C3D, 0x4E5F, 0x0607, {0x08, 0x09, 0xAA, 0xBB, 0xCC, 0xDD, 0xEE, 0x0F}}),
      "0A1B2C3D-4E5F-0607-0809-AABBCCDDEE0F");
  EXPECT_EQ(guidText({}), "00000000-0000-0000-0000-000000000000");
}

TEST(myGUID, IsReadFromItsTextInEitherCase) {
  const myGUID guid = {
      0x0A1B2C3D, 0x4E5F, 0x0607, {0x08, 0x09, 0xAA, 0xBB, 0xCC, 0xDD, 0xEE, 0x0F}};
  EXPECT_EQ(guidFromText("0A1B2C3D-4E5F-0607-0809-AABBCCDDEE0F"), guid);
  EXPECT_EQ(guidFromText("0a1b2c3d-4e5f-0607-0809-aabbccddee0f"), guid);
  EXPECT_EQ(guidFromText("00000000-0000-0000-0000-000000000000"), myGUID());
  EXPECT_EQ(
      guidFromText("FFFFFFFF-FFFF-FFFF-FFFF-FFFFFFFFFFFF"),
      (myGUID{0xFFFFFFFFu, 0xFFFF, 0xFFFF, {0xFF, 0xFF, 0xFF, 0xFF, 0xFF, 0xFF, 0xFF, 0xFF}}));
}

TEST(myGUID, IsNotReadFromAnyOtherText) {
  const std::string good = "0A1B2C3D-4E5F-0607-0809-AABBCCDDEE0F";
  for (std::size_t size = 0; size < good.size(); ++size)
    EXPECT_EQ(guidFromText(good.substr(0, size)), std::nullopt) << size;
  for (std::size_t at = 0; at < good.size(); ++at) {
    for (const char wrong : {'G', ' ', '/', ':', '@', '`', '\0', '\xFF', '-', '0'}) {
      std::string text = good;
      text[at] = wrong;
      const bool isGood = (wrong == '0') != (good[at] == '-') && (wrong == '0' || wrong == '-');
      EXPECT_EQ(guidFromText(text).has_value(), isGood) << text;
    }
  }
  EXPECT_EQ(guidFromText(good + "0"), std::nullopt);
  EXPECT_EQ(guidFromText("{" + good + "}"), std::nullopt);
  EXPECT_EQ(guidFromText(" " + good.substr(1)), std::nullopt);
}

TEST(myGUID, TextShowsTheLow32BitsOfData1) {
  if (!is64Bit) GTEST_SKIP();
  EXPECT_EQ(guidText({wide(0xFFFFFFFF12345678u), 0, 0, {}}),
            "12345678-0000-0000-0000-000000000000");
}

}  // namespace
}  // namespace oxmv::test
