// The three sizings of text, and text that ASCII does not hold. One leaves room for a NUL (REEL),
// one does not (TIMC), and one writes a record an element (KWRd).

#include <string>
#include <string_view>

#include <gtest/gtest.h>

#include "oxmv/values/Array.h"
#include "tests/support/Decoding.h"
#include "tests/support/Encoding.h"
#include "tests/support/Printing.h"
#include "tests/support/StreamBuilder.h"

namespace oxmv::test {
namespace {

using namespace std::string_view_literals;

const std::string clapper = "\xF0\x9F\x8E\xAC";  // U+1F3AC, two UTF-16 units

std::string letters(std::size_t count) {
  std::string text(count, 'a');
  for (std::size_t i = 0; i < count; ++i) text[i] = static_cast<char>('a' + i % 26);
  return text;
}

// A record: its size, the text, and zeros up to the size.
Bytes textRecord(std::string_view tag, std::uint32_t size, std::string_view text) {
  Bytes payload = bytesOf(text);
  payload.resize(size);
  return StreamBuilder().header(tag, size, 'c').raw(payload).bytes();
}

Bytes reel(const Value& text) { return encoded(Dictionary{{"REEL", text}}); }
Bytes timecode(const Value& text) { return encoded(Dictionary{{"TIMC", text}}); }
Bytes keyword(const Value& text) { return encoded(Dictionary{{"KWRd", Array::of(text)}}); }

TEST(TagStreamEncoderText, ElevenCharactersOfTimecodeGiveSize12) {
  EXPECT_EQ(timecode("01:00:00:00"), (Bytes{'T', 'I', 'M', 'C', 12,  0,   0,   'c', '0', '1',
                                            ':', '0', '0', ':', '0', '0', ':', '0', '0', 0}));
}

TEST(TagStreamEncoderText, FourCharactersOfReelGiveSize8) {
  EXPECT_EQ(reel("A001"),
            (Bytes{'R', 'E', 'E', 'L', 8, 0, 0, 'c', 'A', '0', '0', '1', 0, 0, 0, 0}));
}

TEST(TagStreamEncoderText, NameOf300CharactersIsCutTo255AndAZero) {
  const Bytes stream = encoded(Dictionary{{"NAME", letters(300)}});
  ASSERT_EQ(stream.size(), 8u + 256u);
  EXPECT_EQ(Bytes(stream.begin(), stream.begin() + 8), (Bytes{'N', 'A', 'M', 'E', 0, 1, 0, 'c'}));
  EXPECT_EQ(Bytes(stream.begin() + 8, stream.end() - 1), bytesOf(letters(255)));
  EXPECT_EQ(stream.back(), 0);
}

// The number of characters, and the sizes that they give.
struct Sizes {
  std::size_t characters;
  std::uint32_t withNul;     // REEL
  std::uint32_t withoutNul;  // TIMC, KWRd
};
constexpr Sizes sizes[] = {{1, 4, 4},       {2, 4, 4},       {3, 4, 4},       {4, 8, 4},
                           {5, 8, 8},       {7, 8, 8},       {8, 12, 8},      {250, 252, 252},
                           {251, 252, 252}, {252, 256, 252}, {253, 256, 256}, {254, 256, 256},
                           {255, 256, 256}, {256, 256, 256}, {257, 256, 256}, {300, 256, 256},
                           {5000, 256, 256}};

TEST(TagStreamEncoderText, SizesAtEveryBoundary) {
  for (const auto& [characters, withNul, withoutNul] : sizes) {
    const std::string text = letters(characters);
    const std::string kept = text.substr(0, 255);
    EXPECT_EQ(reel(text), textRecord("REEL", withNul, kept)) << characters;
    EXPECT_EQ(timecode(text), textRecord("TIMC", withoutNul, kept)) << characters;
    EXPECT_EQ(keyword(text), textRecord("KWRd", withoutNul, kept)) << characters;
  }
}

TEST(TagStreamEncoderText, BothLayoutsWriteTheSameText) {
  for (const std::size_t count : {0u, 1u, 4u, 255u, 300u}) {
    const Dictionary tags{{"REEL", letters(count)},
                          {"TIMC", letters(count)},
                          {"KWRd", Array::of(letters(count))},
                          {"TAG ", Dictionary{{letters(count), letters(count)}}}};
    EXPECT_EQ(encoded(tags, Layout::readable), encoded(tags, Layout::exact)) << count;
  }
}

TEST(TagStreamEncoderText, EmptyTextIsNoRecord) {
  EXPECT_EQ(reel(""), Bytes());
  EXPECT_EQ(timecode(""), Bytes());
}

TEST(TagStreamEncoderText, KeepsEmptyElementAsAHeader) {
  EXPECT_EQ(keyword(""), (Bytes{'K', 'W', 'R', 'd', 0, 0, 0, 'c'}));
  EXPECT_EQ(encoded(Dictionary{{"KWRd", Array::of("a", "", "b")}}),
            (Bytes{'K', 'W', 'R', 'd', 4, 0, 0, 'c', 'a', 0, 0, 0,  //
                   'K', 'W', 'R', 'd', 0, 0, 0, 'c',                //
                   'K', 'W', 'R', 'd', 4, 0, 0, 'c', 'b', 0, 0, 0}));
}

TEST(TagStreamEncoderText, ElementThatIsNoTextIsAHeader) {
  for (const Value& element : {Value(5), Value(1.5f), Value::data(Bytes{'a'}),
                               Value(Array::of("a")), Value(Dictionary{{"a", "a"}})}) {
    EXPECT_EQ(keyword(element), (Bytes{'K', 'W', 'R', 'd', 0, 0, 0, 'c'}));
  }
}

TEST(TagStreamEncoderText, ArrayWithoutElementsIsNoRecord) {
  EXPECT_EQ(encoded(Dictionary{{"KWRd", Array()}}), Bytes());
}

TEST(TagStreamEncoderText, DerivedTextIsTextToo) {
  EXPECT_EQ(reel(Value::derivedText("A1")), reel("A1"));
  EXPECT_EQ(timecode(Value::derivedText("A1")), timecode("A1"));
  EXPECT_EQ(keyword(Value::derivedText("A1")), keyword("A1"));
  EXPECT_EQ(encoded(Dictionary{{"DTAG", Value::derivedText("ABCD")}}),
            (Bytes{'D', 'T', 'A', 'G', 4, 0, 0, 'F', 'A', 'B', 'C', 'D'}));
}

TEST(TagStreamEncoderText, NulWithinIsWritten) {
  EXPECT_EQ(reel("a\0b"sv), (Bytes{'R', 'E', 'E', 'L', 4, 0, 0, 'c', 'a', 0, 'b', 0}));
  EXPECT_EQ(reel("\0"sv), (Bytes{'R', 'E', 'E', 'L', 4, 0, 0, 'c', 0, 0, 0, 0}));
  EXPECT_EQ(timecode("a\0b\0"sv), (Bytes{'T', 'I', 'M', 'C', 4, 0, 0, 'c', 'a', 0, 'b', 0}));
  EXPECT_EQ(keyword("\0\0\0\0\0"sv),
            (Bytes{'K', 'W', 'R', 'd', 8, 0, 0, 'c', 0, 0, 0, 0, 0, 0, 0, 0}));
}

TEST(TagStreamEncoderText, KeepsTimecodeThatFillsItsPayload) {
  // No NUL stands between the text and the next record.
  EXPECT_EQ(encoded(Dictionary{{"TIMC", "01:00:00"}, {"TAKE", 1}}),
            (Bytes{'T', 'I', 'M', 'C', 8,   0,   0, 'c', '0', '1', ':', '0', '0', ':',
                   '0', '0', 'T', 'A', 'K', 'E', 4, 0,   0,   'B', 1,   0,   0,   0}));
}

TEST(TagStreamEncoderText, KeepsFourCharacterCodeThatFillsItsPayload) {
  EXPECT_EQ(encoded(Dictionary{{"DTAG", "ABCD"}, {"TAKE", 1}}),
            (Bytes{'D', 'T', 'A', 'G', 4, 0, 0, 'F', 'A', 'B', 'C', 'D',  //
                   'T', 'A', 'K', 'E', 4, 0, 0, 'B', 1,   0,   0,   0}));
}

// Letters that ASCII lacks: zeros take the place of the whole text, and the size stays.

TEST(TagStreamEncoderText, LetterThatIsNotAsciiMakesThePayloadZeros) {
  EXPECT_EQ(reel("Caf\xC3\xA9"),  // four characters
            (Bytes{'R', 'E', 'E', 'L', 8, 0, 0, 'c', 0, 0, 0, 0, 0, 0, 0, 0}));
  EXPECT_EQ(timecode("Caf\xC3\xA9"), (Bytes{'T', 'I', 'M', 'C', 4, 0, 0, 'c', 0, 0, 0, 0}));
  EXPECT_EQ(keyword("Caf\xC3\xA9"), (Bytes{'K', 'W', 'R', 'd', 4, 0, 0, 'c', 0, 0, 0, 0}));
  EXPECT_EQ(reel("Caf\xE9"),  // read as ISO-8859-1: the same
            (Bytes{'R', 'E', 'E', 'L', 8, 0, 0, 'c', 0, 0, 0, 0, 0, 0, 0, 0}));
}

TEST(TagStreamEncoderText, LetterThatIsNotAsciiCountsAsOneCharacter) {
  // 3 letters of 3 bytes each: with the NUL 4 characters, without it 3.
  EXPECT_EQ(reel("\xE2\x82\xAC\xE2\x82\xAC\xE2\x82\xAC"), textRecord("REEL", 4, ""));
  EXPECT_EQ(timecode("\xE2\x82\xAC\xE2\x82\xAC\xE2\x82\xAC"), textRecord("TIMC", 4, ""));
}

TEST(TagStreamEncoderText, CharacterAboveFFFFCountsAsTwo) {
  EXPECT_EQ(reel(clapper + "a"), textRecord("REEL", 4, ""));
  EXPECT_EQ(reel(clapper + clapper), textRecord("REEL", 8, ""));
  EXPECT_EQ(timecode(clapper + clapper), textRecord("TIMC", 4, ""));
  EXPECT_EQ(timecode(clapper + clapper + "a"), textRecord("TIMC", 8, ""));
}

TEST(TagStreamEncoderText, OnlyTheKept255CharactersHaveToBeAscii) {
  for (const std::string& letter :
       {std::string("\xC3\xA9"), std::string("\xE2\x82\xAC"), clapper}) {
    EXPECT_EQ(reel(letters(255) + letter), textRecord("REEL", 256, letters(255))) << letter;
    EXPECT_EQ(reel(letters(254) + letter), textRecord("REEL", 256, "")) << letter;
    EXPECT_EQ(reel(letters(253) + letter), textRecord("REEL", 256, "")) << letter;
    EXPECT_EQ(timecode(letters(255) + letter), textRecord("TIMC", 256, letters(255))) << letter;
    EXPECT_EQ(timecode(letters(254) + letter), textRecord("TIMC", 256, "")) << letter;
    EXPECT_EQ(keyword(letters(255) + letter), textRecord("KWRd", 256, letters(255))) << letter;
    EXPECT_EQ(keyword(letters(254) + letter), textRecord("KWRd", 256, "")) << letter;
  }
}

TEST(TagStreamEncoderText, CharacterAtTheCutDecidesTheSize) {
  // 251 and 1: 252 without a NUL. 251 and 2: 253.
  EXPECT_EQ(timecode(letters(251) + "\xC3\xA9"), textRecord("TIMC", 252, ""));
  EXPECT_EQ(timecode(letters(251) + clapper), textRecord("TIMC", 256, ""));
  EXPECT_EQ(reel(letters(250) + "\xC3\xA9"), textRecord("REEL", 252, ""));
  EXPECT_EQ(reel(letters(250) + clapper), textRecord("REEL", 256, ""));
}

TEST(TagStreamEncoderText, LongTextOfWideLettersIsCutToo) {
  std::string text;
  for (int i = 0; i < 1000; ++i) text += clapper;
  EXPECT_EQ(reel(text), textRecord("REEL", 256, ""));
  std::string ofThree;
  for (int i = 0; i < 200; ++i) ofThree += "\xE2\x82\xAC";  // 600 bytes, 200 characters
  EXPECT_EQ(timecode(ofThree), textRecord("TIMC", 200, ""));
  EXPECT_EQ(reel(ofThree), textRecord("REEL", 204, ""));
}

// The two groups.

TEST(TagStreamEncoderGroups, TagGroupIsARecordANameAndARecordAValue) {
  EXPECT_EQ(encoded(Dictionary{{"TAG ", Dictionary{{"ISO", 400}, {"Lens", "35mm"}}}}),
            (Bytes{'T', 'A', 'G', 'N', 4, 0, 0, 'c', 'I',  'S',  'O', 0,                //
                   'T', 'A', 'G', 'V', 4, 0, 0, 'L', 0x90, 0x01, 0,   0,                //
                   'T', 'A', 'G', 'N', 8, 0, 0, 'c', 'L',  'e',  'n', 's', 0, 0, 0, 0,  //
                   'T', 'A', 'G', 'V', 8, 0, 0, 'c', '3',  '5',  'm', 'm', 0, 0, 0, 0}));
}

TEST(TagStreamEncoderGroups, EmptyTextStillGivesARecordOfSize4) {
  EXPECT_EQ(encoded(Dictionary{{"TAG ", Dictionary{{"", ""}}}}),
            (Bytes{'T', 'A', 'G', 'N', 4, 0, 0, 'c', 0, 0, 0, 0,  //
                   'T', 'A', 'G', 'V', 4, 0, 0, 'c', 0, 0, 0, 0}));
  EXPECT_EQ(encoded(Dictionary{{"REG ", Dictionary{{"", 5}}}}),
            (Bytes{'R', 'E', 'G', 'N', 4, 0, 0, 'c', 0, 0, 0, 0,  //
                   'R', 'E', 'G', 'V', 4, 0, 0, 'L', 5, 0, 0, 0}));
}

TEST(TagStreamEncoderGroups, EmptyGroupIsNoRecord) {
  EXPECT_EQ(encoded(Dictionary{{"TAG ", Dictionary()}, {"REG ", Dictionary()}}), Bytes());
}

TEST(TagStreamEncoderGroups, TagGroupTakesTextOfEveryKindForText) {
  EXPECT_EQ(encoded(Dictionary{{"TAG ", Dictionary{{"a", Value::derivedText("12")}}}}),
            (Bytes{'T', 'A', 'G', 'N', 4, 0, 0, 'c', 'a', 0,   0, 0,  //
                   'T', 'A', 'G', 'V', 4, 0, 0, 'c', '1', '2', 0, 0}));
}

TEST(TagStreamEncoderGroups, ValueThatIsNoTextIsANumber) {
  for (const auto& [value, low] : {std::pair(Value(7.9f), std::uint8_t{7}),
                                   {Value(7.9), 7},
                                   {Value::data(Bytes{7}), 0},
                                   {Value(Array::of(7)), 0},
                                   {Value(Dictionary{{"a", 7}}), 0}}) {
    EXPECT_EQ(encoded(Dictionary{{"TAG ", Dictionary{{"a", value}}}}),
              (Bytes{'T', 'A', 'G', 'N', 4, 0, 0, 'c', 'a', 0, 0, 0,  //
                     'T', 'A', 'G', 'V', 4, 0, 0, 'L', low, 0, 0, 0}));
    EXPECT_EQ(encoded(Dictionary{{"REG ", Dictionary{{"a", value}}}}),
              (Bytes{'R', 'E', 'G', 'N', 4, 0, 0, 'c', 'a', 0, 0, 0,  //
                     'R', 'E', 'G', 'V', 4, 0, 0, 'L', low, 0, 0, 0}));
  }
}

TEST(TagStreamEncoderGroups, KeepsRegTextAsASecondName) {
  const Bytes stream = {'R', 'E', 'G', 'N', 8, 0, 0, 'c', 'M', 'o', 'd', 'e', 'l', 0, 0, 0,  //
                        'R', 'E', 'G', 'N', 4, 0, 0, 'c', 'X', 0,   0,   0,                  //
                        'R', 'E', 'G', 'N', 8, 0, 0, 'c', 'C', 'o', 'u', 'n', 't', 0, 0, 0,  //
                        'R', 'E', 'G', 'V', 4, 0, 0, 'L', 3,   0,   0,   0};
  EXPECT_EQ(encoded(Dictionary{{"REG ", Dictionary{{"Model", "X"}, {"Count", 3}}}}), stream);
  EXPECT_EQ(decoded(stream), (Dictionary{{"REG ", Dictionary{{"Count\0\0\0"sv, 3}}}}))
      << "the text is lost on the way back";
}

TEST(TagStreamEncoderGroups, KeepsDerivedRegTextAsANumber) {
  EXPECT_EQ(encoded(Dictionary{{"REG ", Dictionary{{"a", Value::derivedText("12x")}}}}),
            (Bytes{'R', 'E', 'G', 'N', 4, 0, 0, 'c', 'a', 0, 0, 0,  //
                   'R', 'E', 'G', 'V', 4, 0, 0, 'L', 12,  0, 0, 0}));
}

TEST(TagStreamEncoderGroups, NamesAndTextsAreCutAndConvertedLikeAnyText) {
  StreamBuilder expected;
  Bytes kept = bytesOf(letters(255));
  kept.push_back(0);
  expected.record("TAGN", 'c', kept).record("TAGV", 'c', Bytes(8, 0));
  EXPECT_EQ(encoded(Dictionary{{"TAG ", Dictionary{{letters(300), "Caf\xC3\xA9"}}}}),
            expected.bytes());
}

TEST(TagStreamEncoderGroups, EntriesStandInTheGroupsOwnOrder) {
  Dictionary group;
  for (const char* name : {"z", "REEL", "a", "z"}) group.set(name, static_cast<int>(group.size()));
  StreamBuilder expected;
  expected.record("TAGN", 'c', "z\0\0\0"sv).record("TAGV", 'L', 3);
  expected.record("TAGN", 'c', "REEL\0\0\0\0"sv).record("TAGV", 'L', 1);
  expected.record("TAGN", 'c', "a\0\0\0"sv).record("TAGV", 'L', 2);
  EXPECT_EQ(encoded(Dictionary{{"TAG ", group}}), expected.bytes());
}

}  // namespace
}  // namespace oxmv::test
