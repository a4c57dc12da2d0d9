#include <string>

#include <gtest/gtest.h>

#include "oxmv/values/Characters.h"

namespace oxmv {
namespace {

TEST(Characters, KeepWhatCanBeSeen) {
  EXPECT_EQ(visible(""), "");
  EXPECT_EQ(visible("A001 \\ \"é\" \xF0\x9F\x8E\xA5"), "A001 \\ \"é\" \xF0\x9F\x8E\xA5");
}

TEST(Characters, ShowControlCharactersByTheirNumbers) {
  EXPECT_EQ(visible(std::string_view("\0\t\n\x1B\x7F", 5)), "\\x00\\x09\\x0A\\x1B\\x7F");
  EXPECT_EQ(visible("A001 ~\x7F"), "A001 ~\\x7F");
  EXPECT_EQ(visible("\xC2\x80\xC2\x9B\xC2\x9F\xC2\xA0"), "\\u{0080}\\u{009B}\\u{009F}\xC2\xA0");
}

TEST(Characters, ShowThoseThatTurnTextAround) {
  EXPECT_EQ(visible("\xD8\x9C"), "\\u{061C}");
  EXPECT_EQ(visible("\xE2\x80\x8E\xE2\x80\x8F"), "\\u{200E}\\u{200F}");
  EXPECT_EQ(visible("\xE2\x80\xAA\xE2\x80\xAB\xE2\x80\xAC\xE2\x80\xAD\xE2\x80\xAE"),
            "\\u{202A}\\u{202B}\\u{202C}\\u{202D}\\u{202E}");
  EXPECT_EQ(visible("\xE2\x81\xA6\xE2\x81\xA7\xE2\x81\xA8\xE2\x81\xA9"),
            "\\u{2066}\\u{2067}\\u{2068}\\u{2069}");
  EXPECT_EQ(visible("\xE2\x80\xA8\xE2\x80\xA9"), "\\u{2028}\\u{2029}");
}

TEST(Characters, ShowBytesThatAreNotUtf8) {
  EXPECT_EQ(visible("a\xFF"), "a\\xFF");
  EXPECT_EQ(visible("\xC3"), "\\xC3");
  EXPECT_EQ(visible("\xC3(\xE2\x82"), "\\xC3(\\xE2\\x82");
  EXPECT_EQ(visible("\xED\xA0\x80"), "\\xED\\xA0\\x80");
}

TEST(Characters, CutWholeCharacters) {
  EXPECT_EQ(firstCharacters("aé\xF0\x9F\x8E\xA5z", 3), "aé\xF0\x9F\x8E\xA5");
  EXPECT_EQ(firstCharacters("ab", 5), "ab");
  EXPECT_EQ(firstCharacters("ab", 0), "");
}

TEST(Characters, TakeAColumnEach) {
  EXPECT_EQ(columns("aé\xF0\x9F\x8E\xA5"), 3u);
  EXPECT_EQ(columns(""), 0u);
}

}  // namespace
}  // namespace oxmv
