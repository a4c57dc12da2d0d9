#include <string_view>
#include <vector>

#include <gtest/gtest.h>

#include "oxmv/looks/LookNames.h"

namespace oxmv {
namespace {

constexpr auto less = std::weak_ordering::less;
constexpr auto same = std::weak_ordering::equivalent;
constexpr auto greater = std::weak_ordering::greater;

TEST(LookNames, AreComparedWithoutCase) {
  EXPECT_EQ(compareLookNames("warm", "WARM"), same);
  EXPECT_EQ(compareLookNames("Cold", "warm"), less);
  EXPECT_EQ(compareLookNames("warm", "Cold"), greater);
  EXPECT_EQ(compareLookNames("warm", "warmer"), less);
  EXPECT_EQ(compareLookNames("", ""), same);
  EXPECT_EQ(compareLookNames("", "a"), less);
}

TEST(LookNames, WithAccentsAreComparedWithoutCase) {
  EXPECT_EQ(compareLookNames("\u00C9t\u00E9", "\u00E9T\u00C9"), same);
  EXPECT_EQ(compareLookNames("\u00E9", "e"), greater);
}

TEST(LookNames, ComposedAndDecomposedAreEqual) {
  EXPECT_EQ(compareLookNames("\u00C9t\u00E9", "e\u0301te\u0301"), same);
}

TEST(LookNames, ThatAreNoTextAreComparedByByte) {
  EXPECT_EQ(compareLookNames("W\xE4rm", "w\xE4RM"), same);
  EXPECT_EQ(compareLookNames("W\xE4rm", "w\xC4RM"), greater);
  EXPECT_EQ(compareLookNames("W\xE4rm", "W\u00E4rm"), greater);
}

TEST(LookNames, KeepOneOrderAmongAnyThree) {
  const std::vector<std::string_view> names = {
      "a",    "A",    "z", "\u00C9",      "\u00E9", "e\u0301", "\xC3\xA0\xFF",
      "\xFF", "\xC3", "",  "Stra\u00DFe", "STRASSE"};
  for (const auto x : names) {
    for (const auto y : names) {
      EXPECT_EQ(compareLookNames(x, y) < 0, compareLookNames(y, x) > 0);
      for (const auto z : names) {
        if (compareLookNames(x, y) <= 0 && compareLookNames(y, z) <= 0) {
          EXPECT_TRUE(compareLookNames(x, z) <= 0) << x << ' ' << y << ' ' << z;
        }
      }
    }
  }
}

}  // namespace
}  // namespace oxmv
