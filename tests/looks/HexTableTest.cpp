#include <algorithm>
#include <cctype>
#include <cstdlib>
#include <random>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "oxmv/looks/HexTable.h"

namespace oxmv {
namespace {

using Bytes = std::vector<std::uint8_t>;

constexpr std::uint8_t untouched = 0xEE;

struct Read {
  HexTable table;
  Bytes values;  // those stored
};

// Reads with both kinds of instructions, which must agree.
Read read(std::string_view text, std::size_t room = 64) {
  Read first;
  for (const Instructions kind : {Instructions::portable, Instructions::vector}) {
    Bytes values(room * 4, untouched);
    const HexTable table = readHexTable(text, values, kind);
    EXPECT_LE(table.stored, std::min(room, table.groups));
    EXPECT_TRUE(
        std::all_of(values.begin() + static_cast<std::ptrdiff_t>(table.stored * 4), values.end(),
                    [&](auto byte) { return byte == untouched || (byte == 0 && !table.isAscii); }));
    values.resize(table.stored * 4);
    if (kind == Instructions::portable) {
      first = {table, values};
      continue;
    }
    EXPECT_EQ(values, first.values) << text;
    EXPECT_EQ(table.groups, first.table.groups) << text;
    EXPECT_EQ(table.stored, first.table.stored) << text;
    EXPECT_EQ(table.malformed, first.table.malformed) << text;
    EXPECT_EQ(table.firstMalformed, first.table.firstMalformed) << text;
    EXPECT_EQ(table.firstSurplus, first.table.firstSurplus) << text;
    EXPECT_EQ(table.leading, first.table.leading) << text;
    EXPECT_EQ(table.isAscii, first.table.isAscii) << text;
  }
  return first;
}

const Bytes one = {0x00, 0x00, 0x80, 0x3F};
const Bytes half = {0x00, 0x00, 0x00, 0x3F};
const Bytes oneAndHalf = {0x00, 0x00, 0x80, 0x3F, 0x00, 0x00, 0x00, 0x3F};

TEST(HexTable, FirstTwoDigitsAreTheLowestByte) {
  EXPECT_EQ(read("0000803F").values, one);
  EXPECT_EQ(read("12345678").values, (Bytes{0x12, 0x34, 0x56, 0x78}));
}

TEST(HexTable, TakesDigitsOfBothCases) {
  EXPECT_EQ(read("abcdefABCDEF0189").values,
            (Bytes{0xAB, 0xCD, 0xEF, 0xAB, 0xCD, 0xEF, 0x01, 0x89}));
}

TEST(HexTable, TextInQuotationMarksGivesItsValuesOnly) {
  const Read got = read("\"0000803F0000003F\"");
  EXPECT_EQ(got.values, oneAndHalf);
  EXPECT_EQ(got.table.groups, 2u);
  EXPECT_EQ(got.table.malformed, 0u);
  EXPECT_EQ(got.table.leading, 1u);
}

TEST(HexTable, AnythingMayStandBetweenGroups) {
  for (const char* text : {"0000803F 0000003F", "0000803F,0000003F", "0000803F\n\t0000003F",
                           "0000803Fxyz; 0000003F", "0000803F--------------------0000003F"}) {
    EXPECT_EQ(read(text).values, oneAndHalf) << text;
    EXPECT_EQ(read(text).table.malformed, 0u) << text;
  }
}

TEST(HexTable, NoDigitGivesNoValues) {
  for (const char* text : {"", " ", "\n    \n", "xyz", "?\"!"}) {
    const Read got = read(text);
    EXPECT_EQ(got.table.groups, 0u);
    EXPECT_EQ(got.table.leading, std::string_view(text).size());
  }
}

TEST(HexTable, GroupWithAnotherCharacterIsZeroAndCounted) {
  const Read got = read("0000803F 0000zz3F 0000003F");
  EXPECT_EQ(got.values, (Bytes{0x00, 0x00, 0x80, 0x3F, 0, 0, 0, 0, 0x00, 0x00, 0x00, 0x3F}));
  EXPECT_EQ(got.table.malformed, 1u);
  EXPECT_EQ(got.table.firstMalformed, 9u);
}

TEST(HexTable, MalformedGroupTakesEightCharactersWhateverTheyAre) {
  // "8 000080", and then "3F" is cut off.
  const Read got = read("8 0000803F");
  EXPECT_EQ(got.table.groups, 2u);
  EXPECT_EQ(got.table.malformed, 2u);
  EXPECT_EQ(got.values, Bytes(8, 0));
}

TEST(HexTable, GroupCutOffByTheEndIsZeroAndCounted) {
  for (std::size_t length = 1; length < 8; ++length) {
    const Read got = read(std::string("0000803F") + std::string("0000803F", length));
    EXPECT_EQ(got.values, (Bytes{0x00, 0x00, 0x80, 0x3F, 0, 0, 0, 0})) << length;
    EXPECT_EQ(got.table.malformed, 1u);
    EXPECT_EQ(got.table.firstMalformed, 8u);
  }
}

TEST(HexTable, ThreeCharactersBeforeTheFirstDigitAreInOrder) {
  const Read got = read("###0000803F###");
  EXPECT_EQ(got.values, one);
  EXPECT_EQ(got.table.leading, maxLeading);
}

TEST(HexTable, LongerStartIsScannedAllTheSame) {
  const Read got = read("\n        0000803F 0000003F\n    ");
  EXPECT_EQ(got.values, oneAndHalf);
  EXPECT_EQ(got.table.leading, 9u);
}

TEST(HexTable, AsManyCharactersAtTheEndAsAtTheStartBeginNoGroup) {
  // Two before the first digit, so the last two, digits as they are, begin none.
  const Read got = read("##0000803FAB");
  EXPECT_EQ(got.values, one);
  EXPECT_EQ(got.table.malformed, 0u);
  // One more digit: there a group begins, and is cut off.
  EXPECT_EQ(read("##0000803FABC").table.groups, 2u);
}

TEST(HexTable, GroupThatBeginsBeforeTheIgnoredEndMayReachIntoIt) {
  EXPECT_EQ(read("#######0000803F0000003F").values, oneAndHalf);
  // Nine characters before the first digit leave the last group out altogether.
  EXPECT_EQ(read("#########0000803F0000003F").values, one);
}

TEST(HexTable, ValuesWithoutRoomAreCountedNotStored) {
  const Read got = read("0000803F0000003F0000803F", 2);
  EXPECT_EQ(got.values, oneAndHalf);
  EXPECT_EQ(got.table.groups, 3u);
  EXPECT_EQ(got.table.stored, 2u);
  EXPECT_EQ(got.table.firstSurplus, 16u);
  EXPECT_EQ(read("0000803F0000003F", 2).table.firstSurplus, HexTable::none);
  EXPECT_EQ(read("0000803F", 0).table.groups, 1u);
}

TEST(HexTable, TextThatIsNotAsciiIsScannedAllTheSame) {
  const Read got = read("0000803F\u00E90000003F");
  EXPECT_EQ(got.values, oneAndHalf);
  EXPECT_FALSE(got.table.isAscii);
  EXPECT_TRUE(read("0000803F 0000003F").table.isAscii);
}

TEST(HexTable, CharactersThatAreNotAsciiCountAsUtf16CountsThem) {
  // One unit before the first digit: one at the end is ignored, however many bytes it has.
  EXPECT_EQ(read("\u201C0000803F\u201D").values, one);
  EXPECT_EQ(read("\u201C0000803F\u201D").table.leading, 1u);
  // A character above U+FFFF is two units.
  EXPECT_EQ(read("\U0001F3A80000803F00").values, one);
  EXPECT_EQ(read("\U0001F3A80000803F000").table.groups, 2u);
}

TEST(HexTable, CharacterThatIsNotAsciiIsFoundWhereverItStands) {
  const std::string digits(120, '0');
  for (std::size_t at = 0; at <= digits.size(); ++at) {
    std::string text = digits;
    text.insert(at, "\u00E9");
    EXPECT_FALSE(read(text).table.isAscii) << at;
  }
}

TEST(HexTable, GroupWithACharacterThatIsNotAsciiIsEightCharacters) {
  const Read got = read("0000\u20AC03F0000003F");
  EXPECT_EQ(got.values, (Bytes{0, 0, 0, 0, 0x00, 0x00, 0x00, 0x3F}));
  EXPECT_EQ(got.table.malformed, 1u);
}

TEST(HexTable, ValuesStoredBeforeTheTextTurnsOutNotToBeAsciiLeaveZeros) {
  // Counted in bytes the text is longer than in characters, and the second group begins early
  // enough.
  const std::string front(20, '#');
  const Read got = read(front + "0000803F0000003F0000803E\U0001F3A8\U0001F3A8");
  EXPECT_FALSE(got.table.isAscii);
  EXPECT_EQ(got.table.stored, 1u);
  EXPECT_EQ(got.values, one);
}

// The rules as they are written, a character at a time.
Read plainRead(std::string_view text, std::size_t room) {
  const std::string_view digits = "0123456789abcdefABCDEF";
  Read result;
  const std::size_t start = std::min(text.find_first_of(digits), text.size());
  const std::size_t end = text.size() - start;
  for (std::size_t at = text.find_first_of(digits); at < end;
       at = text.find_first_of(digits, at + 8)) {
    const std::string group(text.substr(at, 8));
    ++result.table.groups;
    const bool isGood = group.size() == 8 && group.find_first_not_of(digits) == std::string::npos;
    if (!isGood) ++result.table.malformed;
    if (result.table.stored == room) continue;
    ++result.table.stored;
    for (std::size_t i = 0; i < 8; i += 2) {
      const unsigned long byte = isGood ? std::strtoul(group.substr(i, 2).c_str(), nullptr, 16) : 0;
      result.values.push_back(static_cast<std::uint8_t>(byte));
    }
    if (at + 8 >= text.size()) break;
  }
  return result;
}

TEST(HexTable, RandomTextsAreReadByTheRules) {
  std::mt19937 random(4);
  const std::string_view often = "0123456789abcdefABCDEF";
  const std::string_view seldom = " \n,\"xg@`/:GZ{~";
  for (int i = 0; i < 4000; ++i) {
    const auto oddity = 1 + random() % 200;
    std::string text;
    const std::size_t length = random() % 300;
    while (text.size() < length) {
      const auto& set = random() % oddity == 0 ? seldom : often;
      text += set[random() % set.size()];
    }
    const std::size_t room = random() % 40;
    const Read expected = plainRead(text, room);
    const Read got = read(text, room);
    ASSERT_EQ(got.values, expected.values) << text;
    ASSERT_EQ(got.table.groups, expected.table.groups) << text;
    ASSERT_EQ(got.table.malformed, expected.table.malformed) << text;
  }
}

TEST(HexTable, RandomSpacedTextsAreReadByTheRules) {
  std::mt19937 random(7);
  for (int i = 0; i < 4000; ++i) {
    const std::string gap(random() % 6, " ,\n;"[random() % 4]);
    std::string text = std::string(random() % 4, '"');
    const auto count = random() % 20;
    for (std::size_t k = 0; k < count; ++k) {
      for (int digit = 0; digit < 8; ++digit) text += "0123456789abcdefABCDEF"[random() % 22];
      text += gap;
    }
    // One character is another one, or there is one more or less.
    if (!text.empty() && random() % 2 == 0) {
      const auto at = random() % text.size();
      switch (random() % 3) {
        case 0: text[at] = " 0f,x"[random() % 5]; break;
        case 1: text.insert(at, 1, " 0f,x"[random() % 5]); break;
        default: text.erase(at, 1);
      }
    }
    const std::size_t room = random() % 24;
    const Read expected = plainRead(text, room);
    const Read got = read(text, room);
    ASSERT_EQ(got.values, expected.values) << text;
    ASSERT_EQ(got.table.groups, expected.table.groups) << text;
    ASSERT_EQ(got.table.malformed, expected.table.malformed) << text;
  }
}

TEST(HexTable, CharacterThatIsNotAsciiIsFoundInEveryGap) {
  for (std::size_t at = 0; at < 20; ++at) {
    std::string text;
    for (std::size_t k = 0; k < 20; ++k) text += k == at ? "0000803F\u00E9" : "0000803F ";
    const Read got = read(text);
    EXPECT_FALSE(got.table.isAscii) << at;
    EXPECT_EQ(got.table.groups, 20u) << at;
  }
}

TEST(HexTable, EveryCharacterIsADigitOrNot) {
  for (int c = 1; c < 128; ++c) {
    std::string text(64, '0');
    text[37] = static_cast<char>(c);
    EXPECT_EQ(read(text).table.malformed, std::isxdigit(c) != 0 ? 0u : 1u) << c;
  }
}

TEST(HexTable, GapThatGrowsWhereAGroupIsShorterMakesThatMalformed) {
  // Four groups are taken at once; in the next four a blank stands where the first digit would.
  const std::string spaced = "0000803F 0000803F 0000803F 0000803F ";
  EXPECT_EQ(read(spaced + " 1234567 " + spaced).table.malformed, 1u);
  EXPECT_EQ(read("0000803F " + spaced + " 1234567 " + spaced).table.malformed, 1u);
}

}  // namespace
}  // namespace oxmv
