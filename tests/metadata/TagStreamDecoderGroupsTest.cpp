// The two groups of named entries.

#include <set>
#include <string>
#include <string_view>

#include <gtest/gtest.h>

#include "tests/support/CollidingNames.h"
#include "tests/support/Decoding.h"
#include "tests/support/Printing.h"
#include "tests/support/StreamBuilder.h"

namespace oxmv::test {
namespace {

using namespace std::string_view_literals;

Dictionary tagGroup(const Dictionary& entries) { return Dictionary{{"TAG ", entries}}; }

Dictionary regGroup(const Dictionary& entries) { return Dictionary{{"REG ", entries}}; }

TEST(TagStreamDecoderGroups, NameAndNumberMakeAnEntry) {
  EXPECT_EQ(decoded({'T', 'A', 'G', 'N', 4, 0, 0, 'c', 'I',  'S',  'O', 0,  //
                     'T', 'A', 'G', 'V', 4, 0, 0, 'L', 0x90, 0x01, 0,   0}),
            tagGroup({{"ISO", 400}}));
}

TEST(TagStreamDecoderGroups, NameAndTextMakeAnEntry) {
  EXPECT_EQ(decoded({'T', 'A', 'G', 'N', 8, 0, 0, 'c', 'L', 'e', 'n', 's', 0, 0, 0, 0,  //
                     'T', 'A', 'G', 'V', 8, 0, 0, 'c', '3', '5', 'm', 'm', 0, 0, 0, 0}),
            tagGroup({{"Lens", "35mm"}}));
}

TEST(TagStreamDecoderGroups, RegGroupHasItsOwnRecords) {
  EXPECT_EQ(decoded({'R', 'E', 'G', 'N', 4, 0, 0, 'c', 'I',  'S',  'O',  '!',  //
                     'R', 'E', 'G', 'V', 4, 0, 0, 'L', 0xFE, 0xFF, 0xFF, 0xFF,
                     'R', 'E', 'G', 'N', 4, 0, 0, 'c', 'L',  'e',  'n',  's',  //
                     'R', 'E', 'G', 'V', 4, 0, 0, 'c', '3',  '5',  'm',  'm'}),
            regGroup({{"ISO!", -2}, {"Lens", "35mm"}}));
}

// Padding.

TEST(TagStreamDecoderGroups, TagNameAndTextLoseTheNulsAtTheirEnd) {
  StreamBuilder stream;
  stream.record("TAGN", 'c', "a\0b\0\0\0"sv).record("TAGV", 'c', "\0c\0d\0\0\0"sv);
  EXPECT_EQ(decoded(stream.bytes()), tagGroup({{"a\0b"sv, "\0c\0d"sv}}));
}

TEST(TagStreamDecoderGroups, KeepsPaddingInRegNamesAndTexts) {
  EXPECT_EQ(decoded({'R', 'E', 'G', 'N', 8, 0, 0, 'c', 'M', 'o', 'd', 'e', 'l', 0, 0, 0,  //
                     'R', 'E', 'G', 'V', 4, 0, 0, 'c', 'a', 'b', 'c', 0}),
            regGroup({{"Model\0\0\0"sv, "abc\0"sv}}));
}

TEST(TagStreamDecoderGroups, EmptyNameIsAName) {
  StreamBuilder ofSize0, ofNuls, ofReg;
  ofSize0.header("TAGN", 0, 'c').record("TAGV", 'L', 5);
  EXPECT_EQ(decoded(ofSize0.bytes()), tagGroup({{"", 5}}));
  ofNuls.record("TAGN", 'c', "\0\0\0\0"sv).record("TAGV", 'L', 6);
  EXPECT_EQ(decoded(ofNuls.bytes()), tagGroup({{"", 6}}));
  ofReg.header("REGN", 0, 'c').record("REGV", 'L', 7);
  EXPECT_EQ(decoded(ofReg.bytes()), regGroup({{"", 7}}));
}

TEST(TagStreamDecoderGroups, EmptyTextIsAValue) {
  StreamBuilder stream;
  stream.record("TAGN", 'c', "a").header("TAGV", 0, 'c');
  stream.record("REGN", 'c', "b").header("REGV", 0, 'c');
  EXPECT_EQ(decoded(stream.bytes()),
            (Dictionary{{"TAG ", Dictionary{{"a", ""}}}, {"REG ", Dictionary{{"b", ""}}}}));
}

// Types.

TEST(TagStreamDecoderGroups, TagValueIsTextOfTypeSmallCOnly) {
  for (int type = 0; type <= 0xFF; ++type) {
    StreamBuilder stream;
    stream.record("TAGN", 'c', "n").record("TAGV", static_cast<char>(type), "ab\0\0"sv);
    const Value expected = type == 0x63 ? Value("ab") : Value(0x6261);
    EXPECT_EQ(decoded(stream.bytes()), tagGroup({{"n", expected}})) << type;
  }
}

TEST(TagStreamDecoderGroups, RegValueIsANumberOfTypeLOnly) {
  for (int type = 0; type <= 0xFF; ++type) {
    StreamBuilder stream;
    stream.record("REGN", 'c', "n").record("REGV", static_cast<char>(type), "ab\0\0"sv);
    const Value expected = type == 0x4C ? Value(0x6261) : Value("ab\0\0"sv);
    EXPECT_EQ(decoded(stream.bytes()), regGroup({{"n", expected}})) << type;
  }
}

TEST(TagStreamDecoderGroups, NumberTakesFourBytesWhateverTheSize) {
  StreamBuilder stream;
  stream.record("TAGN", 'c', "n").record("TAGV", 'L', Bytes{5, 0, 0, 0, 1, 1, 1, 1});
  stream.record("REGN", 'c', "n").record("REGV", 'L', Bytes{6, 0, 0, 0, 1, 1, 1, 1});
  EXPECT_EQ(decoded(stream.bytes()),
            (Dictionary{{"TAG ", Dictionary{{"n", 5}}}, {"REG ", Dictionary{{"n", 6}}}}));
}

// Pending names.

TEST(TagStreamDecoderGroups, ValueWithoutANameIsIgnored) {
  StreamBuilder stream;
  stream.record("TAGV", 'L', 1).record("REGV", 'L', 2).record("PRCS", 'L', 3);
  EXPECT_EQ(decoded(stream.bytes()), (Dictionary{{"PRCS", 3}}));
}

TEST(TagStreamDecoderGroups, NameWithoutAValueLeavesNoTrace) {
  StreamBuilder stream;
  stream.record("TAGN", 'c', "a").record("REGN", 'c', "b").record("PRCS", 'L', 3);
  EXPECT_EQ(decoded(stream.bytes()), (Dictionary{{"PRCS", 3}}));
}

TEST(TagStreamDecoderGroups, SecondNameReplacesTheFirst) {
  StreamBuilder stream;
  stream.record("TAGN", 'c', "old").record("TAGN", 'c', "new").record("TAGV", 'L', 5);
  stream.record("REGN", 'c', "old ").record("REGN", 'c', "new ").record("REGV", 'L', 6);
  EXPECT_EQ(decoded(stream.bytes()),
            (Dictionary{{"TAG ", Dictionary{{"new", 5}}}, {"REG ", Dictionary{{"new ", 6}}}}));
}

TEST(TagStreamDecoderGroups, NameIsUsedOnce) {
  StreamBuilder stream;
  stream.record("TAGN", 'c', "a").record("TAGV", 'L', 1).record("TAGV", 'L', 2);
  stream.record("REGN", 'c', "b").record("REGV", 'L', 3).record("REGV", 'L', 4);
  EXPECT_EQ(decoded(stream.bytes()),
            (Dictionary{{"TAG ", Dictionary{{"a", 1}}}, {"REG ", Dictionary{{"b", 3}}}}));
}

TEST(TagStreamDecoderGroups, NamesOfTheTwoGroupsAreIndependent) {
  StreamBuilder stream;
  stream.record("TAGN", 'c', "a").record("REGN", 'c', "b");
  stream.record("REGV", 'L', 1).record("TAGV", 'L', 2);
  EXPECT_EQ(decoded(stream.bytes()),
            (Dictionary{{"REG ", Dictionary{{"b", 1}}}, {"TAG ", Dictionary{{"a", 2}}}}));

  StreamBuilder crossed;
  crossed.record("TAGN", 'c', "a").record("REGV", 'L', 1);
  EXPECT_EQ(decoded(crossed.bytes()), Dictionary());
}

TEST(TagStreamDecoderGroups, OtherRecordsMayStandBetweenNameAndValue) {
  StreamBuilder stream;
  stream.record("TAGN", 'c', "a").record("PRCS", 'L', 3).record("ZZZZ", 'L', 4);
  stream.marker(1).record("TAGV", 'L', 2);
  EXPECT_EQ(decoded(stream.bytes()), (Dictionary{{"PRCS", 3}, {"TAG ", Dictionary{{"a", 2}}}}));
}

TEST(TagStreamDecoderGroups, NameDoesNotReachIntoANestedStream) {
  StreamBuilder inner, stream;
  inner.record("TAGV", 'L', 1).record("REGV", 'L', 1).record("PRCS", 'L', 2);
  stream.record("TAGN", 'c', "a").record("REGN", 'c', "b").record("COL1", 0, inner.bytes());
  stream.record("TAGV", 'L', 3).record("REGV", 'L', 4);
  EXPECT_EQ(decoded(stream.bytes()), (Dictionary{{"COL1", Dictionary{{"PRCS", 2}}},
                                                 {"TAG ", Dictionary{{"a", 3}}},
                                                 {"REG ", Dictionary{{"b", 4}}}}));
}

TEST(TagStreamDecoderGroups, NameDoesNotLeakOutOfANestedStream) {
  StreamBuilder inner, stream;
  inner.record("TAGN", 'c', "a").record("REGN", 'c', "b");
  stream.record("COL1", 0, inner.bytes()).record("TAGV", 'L', 3).record("REGV", 'L', 4);
  EXPECT_EQ(decoded(stream.bytes()), (Dictionary{{"COL1", Dictionary()}}));
}

TEST(TagStreamDecoderGroups, NestedStreamHasGroupsOfItsOwn) {
  StreamBuilder inner, stream;
  inner.record("TAGN", 'c', "in").record("TAGV", 'L', 1);
  stream.record("TAGN", 'c', "out").record("TAGV", 'L', 2).record("COL1", 0, inner.bytes());
  stream.record("TAGN", 'c', "more").record("TAGV", 'L', 3);
  EXPECT_EQ(decoded(stream.bytes()),
            (Dictionary{{"TAG ", Dictionary{{"out", 2}, {"more", 3}}},
                        {"COL1", Dictionary{{"TAG ", Dictionary{{"in", 1}}}}}}));
}

// Places.

TEST(TagStreamDecoderGroups, GroupStandsWhereItsFirstValueStood) {
  StreamBuilder stream;
  stream.record("TAGN", 'c', "a").record("REEL", 'c', "A").record("TAGV", 'L', 1);
  stream.record("TAKE", 'B', 1).record("TAGN", 'c', "b").record("TAGV", 'L', 1);
  EXPECT_EQ(keys(decoded(stream.bytes())), (Names{"REEL", "TAG ", "TAKE"}));
}

TEST(TagStreamDecoderGroups, LastValueOfANameWinsAndKeepsTheFirstPlace) {
  StreamBuilder stream;
  for (const auto& [name, value] : {std::pair("b"sv, 1), {"a"sv, 2}, {"c"sv, 3}, {"b"sv, 4}})
    stream.record("TAGN", 'c', name).record("TAGV", 'L', value);
  const Dictionary group = decoded(stream.bytes())["TAG "].dictionary();
  EXPECT_EQ(group, (Dictionary{{"b", 4}, {"a", 2}, {"c", 3}}));
  EXPECT_EQ(keys(group), (Names{"b", "a", "c"}));
}

TEST(TagStreamDecoderGroups, NameMayLookLikeATag) {
  StreamBuilder stream;
  stream.record("TAGN", 'c', "REEL").record("TAGV", 'L', 1).record("TAGN", 'c', "TAG ");
  stream.record("TAGV", 'L', 2).record("TAGN", 'c', "CTLPData").record("TAGV", 'L', 3);
  EXPECT_EQ(decoded(stream.bytes()), tagGroup({{"REEL", 1}, {"TAG ", 2}, {"CTLPData", 3}}));
}

TEST(TagStreamDecoderGroups, KeyOfAGroupIsNoTag) {
  StreamBuilder stream;
  stream.record("TAG ", 'c', "a").record("REG ", 'L', 1).record("PRCS", 'L', 3);
  EXPECT_EQ(decoded(stream.bytes()), (Dictionary{{"PRCS", 3}}));
}

// Letters.

TEST(TagStreamDecoderGroups, NameThatIsNotUtf8IsReadAsLatin1) {
  StreamBuilder stream;
  stream.record("TAGN", 'c', "Caf\xE9").record("TAGV", 'c', "Caf\xE9");
  stream.record("REGN", 'c', "Caf\xE9").record("REGV", 'c', "Caf\xE9");
  const Dictionary entry{{"Caf\xC3\xA9", "Caf\xC3\xA9"}};
  EXPECT_EQ(decoded(stream.bytes()), (Dictionary{{"TAG ", entry}, {"REG ", entry}}));
}

TEST(TagStreamDecoderGroups, NamesThatBecomeEqualAreOneName) {
  StreamBuilder stream;
  stream.record("TAGN", 'c', "Caf\xC3\xA9").record("TAGV", 'L', 1);
  stream.record("TAGN", 'c', "other").record("TAGV", 'L', 2);
  stream.record("TAGN", 'c', "Caf\xE9").record("TAGV", 'L', 3);
  const Dictionary group = decoded(stream.bytes())["TAG "].dictionary();
  EXPECT_EQ(group, (Dictionary{{"Caf\xC3\xA9", 3}, {"other", 2}}));
  EXPECT_EQ(keys(group), (Names{"Caf\xC3\xA9", "other"}));
  EXPECT_EQ(group["Caf\xE9"], Value(3));
}

TEST(TagStreamDecoderGroups, ConvertedNameMayHaveTheLengthOfATag) {
  // Two bytes of ISO-8859-1 become four of UTF-8, which is no tag for all that.
  StreamBuilder stream;
  stream.record("TAGN", 'c', "\xE9\xE9").record("TAGV", 'L', 1);
  const Dictionary group = decoded(stream.bytes())["TAG "].dictionary();
  EXPECT_EQ(group, (Dictionary{{"\xC3\xA9\xC3\xA9", 1}}));
  EXPECT_TRUE(group.contains("\xC3\xA9\xC3\xA9"));
}

TEST(TagStreamDecoderGroups, NameThatIsNotUtf8IsWholeWhateverItsLength) {
  // In UTF-8 it takes more bytes than a record has.
  StreamBuilder stream;
  stream.record("TAGN", 'c', std::string(0x800000, '\xE9')).record("TAGV", 'L', 1);
  const Dictionary group = decoded(stream.bytes())["TAG "].dictionary();
  ASSERT_EQ(group.size(), 1u);
  EXPECT_EQ((*group.begin()).key.size(), 0x1000000u);
}

// Many names: from some number on they are followed by an order to search in.

TEST(TagStreamDecoderGroups, FindsEveryNameAtEverySize) {
  StreamBuilder stream;
  Names names;
  for (int count = 1; count <= 60; ++count) {
    // Of every kind: as long as a tag, other lengths, not ASCII; in no order.
    std::string name = std::to_string(count * 7919 % 10007);
    if (count % 3 == 0) name += "\xE9";
    if (count % 4 == 0) name = "N" + std::to_string(100 + count);
    stream.record("TAGN", 'c', name).record("TAGV", 'L', count);
    names.push_back(name);

    const Dictionary group = decoded(stream.bytes())["TAG "].dictionary();
    ASSERT_EQ(group.size(), names.size());
    for (std::size_t i = 0; i < names.size(); ++i)
      ASSERT_EQ(group[names[i]], Value(static_cast<int>(i) + 1)) << names[i] << " of " << count;
    for (const char* other : {"", "0", "N000", "Nzzz", "zzzzz", "\xFF"})
      ASSERT_FALSE(group.contains(other)) << other << " of " << count;
  }
}

TEST(TagStreamDecoderGroups, ManyNamesWithRepetitionsKeepOrderAndLastValues) {
  StreamBuilder stream;
  for (int i = 0; i < 1000; ++i)
    stream.record("REGN", 'c', std::to_string(100 + i * 37 % 250)).record("REGV", 'L', i);
  const Dictionary group = decoded(stream.bytes())["REG "].dictionary();
  ASSERT_EQ(group.size(), 250u);
  int first = 0;
  for (const auto& [key, value] : group) {
    // 37 has no divisor in common with 250: the names come round every 250 entries.
    EXPECT_EQ(key, std::to_string(100 + first * 37 % 250));
    EXPECT_EQ(value, Value(750 + first));
    ++first;
  }
}

TEST(TagStreamDecoderGroups, ManyNamesInOneGroupLeaveTheOthersAlone) {
  StreamBuilder inner, stream;
  inner.record("TAGN", 'c', "in").record("TAGV", 'L', 1);
  for (int i = 0; i < 100; ++i) {
    stream.record("TAGN", 'c', "tag" + std::to_string(i)).record("TAGV", 'L', i);
    stream.record("REGN", 'c', std::to_string(1000 + i)).record("REGV", 'L', -i);
    stream.record("DSPm", 0, inner.bytes());
  }
  const Dictionary tags = decoded(stream.bytes());
  EXPECT_EQ(keys(tags), (Names{"TAG ", "REG ", "DSPm"}));
  for (int i = 0; i < 100; ++i) {
    EXPECT_EQ(tags["TAG "].dictionary()["tag" + std::to_string(i)], Value(i));
    EXPECT_EQ(tags["REG "].dictionary()[std::to_string(1000 + i)], Value(-i));
    EXPECT_EQ(tags["DSPm"].array()[static_cast<std::size_t>(i)],
              Value(Dictionary{{"TAG ", Dictionary{{"in", 1}}}}));
  }
}

TEST(TagStreamDecoderGroups, AreNotSlowedDownByNamesThatCollide) {
  const std::vector<std::string> names = collidingNames(50'000);
#if defined(__GLIBCXX__) && SIZE_MAX > 0xFFFFFFFF
  std::set<std::size_t> hashes;
  for (const std::string& name : names) hashes.insert(std::hash<std::string>()(name));
  ASSERT_EQ(hashes.size(), 1u) << "the names are not what this test is about";
#endif
  StreamBuilder stream;
  for (std::size_t i = 0; i < names.size(); ++i)
    stream.record("TAGN", 'c', names[i]).record("TAGV", 'L', static_cast<std::int32_t>(i));
  const Dictionary group = decoded(stream.bytes())["TAG "].dictionary();
  ASSERT_EQ(group.size(), names.size());
  EXPECT_EQ(keys(group), names);
  for (std::size_t i = 0; i < names.size(); ++i)
    ASSERT_EQ(group[names[i]], Value(static_cast<std::int32_t>(i)));
}

}  // namespace
}  // namespace oxmv::test
