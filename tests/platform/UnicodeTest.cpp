#include <gtest/gtest.h>

#include "oxmv/platform/Unicode.h"

namespace oxmv {
namespace {

TEST(CaseFolded, TakesCaseOut) {
  EXPECT_EQ(caseFolded("WaRm 3"), "warm 3");
  EXPECT_EQ(caseFolded("\u00C9T\u00C9"), "\u00E9t\u00E9");
  EXPECT_EQ(caseFolded("Stra\u00DFe"), "strasse");
  EXPECT_EQ(caseFolded("\u03A3\u03C2"), "\u03C3\u03C3");
  EXPECT_EQ(caseFolded(""), "");
}

TEST(CaseFolded, ComposesCharacters) {
  EXPECT_EQ(caseFolded("E\u0301"), "\u00E9");
  EXPECT_EQ(caseFolded("\u1100\u1161"), "\uAC00");
}

TEST(CaseFolded, AccentsInAnotherOrderAreTheSame) {
  // The iota below folds to a letter, which must not part the accent from the alpha.
  EXPECT_EQ(caseFolded("\u03B1\u0345\u0301"), caseFolded("\u1FB4"));
}

TEST(CaseFolded, KeepsZeros) {
  EXPECT_EQ(caseFolded(std::string_view("A\0B", 3)), std::string("a\0b", 3));
}

TEST(CaseFolded, InvalidTextIsNothing) {
  for (const char* bytes : {"\xFF", "a\xC3", "\xED\xA0\x80", "\xC0\x80", "\x80"}) {
    EXPECT_EQ(caseFolded(bytes), std::nullopt);
  }
}

TEST(TrimmedOfPunctuation, LosesItAtBothEnds) {
  EXPECT_EQ(trimmedOfPunctuation("\"33\""), "33");
  EXPECT_EQ(trimmedOfPunctuation("-8"), "8");
  EXPECT_EQ(trimmedOfPunctuation("\u201C17\u201D"), "17");
  EXPECT_EQ(trimmedOfPunctuation("\u00AB[(_17_)]\u00BB\u2026"), "17");
  EXPECT_EQ(trimmedOfPunctuation("1-7"), "1-7");
}

TEST(TrimmedOfPunctuation, LeavesEverythingElse) {
  for (const char* text : {"33", " 33 ", "+33", "$33", "", "\u20AC", " \"33\" "}) {
    EXPECT_EQ(trimmedOfPunctuation(text), text);
  }
}

TEST(TrimmedOfPunctuation, OfNothingElseIsEmpty) {
  EXPECT_EQ(trimmedOfPunctuation("\""), "");
  EXPECT_EQ(trimmedOfPunctuation("\u201C\u201D-!"), "");
}

}  // namespace
}  // namespace oxmv
