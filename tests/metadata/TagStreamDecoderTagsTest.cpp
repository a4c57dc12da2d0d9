// How a record of every tag is read, rule by rule.

#include <iterator>
#include <set>
#include <string>
#include <string_view>

#include <gtest/gtest.h>

#include "oxmv/metadata/TagTable.h"
#include "oxmv/values/Array.h"
#include "tests/metadata/TagRules.h"
#include "tests/support/Decoding.h"
#include "tests/support/Printing.h"
#include "tests/support/StreamBuilder.h"

namespace oxmv::test {
namespace {

using namespace std::string_view_literals;

// A record of that tag, written byte for byte: size (3), type (1), payload.
Bytes recordOf(std::string_view tag, const Bytes& rest) {
  return StreamBuilder().raw(bytesOf(tag)).raw(rest).bytes();
}

// Expects that a record of each tag, and no more, gives `expected` under the tag, and that it is
// not taken for the clip's identity.
template <std::size_t count>
void expectRead(const std::string_view (&tags)[count], const Bytes& rest, const Value& expected) {
  const myGUID before{1, 2, 3, {4}};
  for (const std::string_view tag : tags) {
    myGUID guid = before;
    EXPECT_EQ(decoded(recordOf(tag, rest), std::nullopt, &guid), (Dictionary{{tag, expected}}))
        << tag;
    EXPECT_EQ(guid, before) << tag;
  }
}

template <std::size_t count>
void expectIgnored(const std::string_view (&tags)[count], const Bytes& rest) {
  for (const std::string_view tag : tags)
    EXPECT_EQ(decoded(recordOf(tag, rest)), Dictionary()) << tag;
}

// A word whose first byte, first two bytes and four bytes differ as numbers.
const Bytes word = {4, 0, 0, 'L', 0xFE, 0xFF, 0xFF, 0xFF};

Bytes floats(int count) {
  Bytes rest = {static_cast<std::uint8_t>(4 * count), 0, 0, 'f'};
  for (int i = 0; i < count; ++i) {
    // 2.0f is 00 00 00 40; each step in the third byte adds a 64th.
    rest.insert(rest.end(), {0, 0, static_cast<std::uint8_t>(i), 0x40});
  }
  return rest;
}

Array floatList(int count) {
  std::vector<Value> elements;
  for (int i = 0; i < count; ++i) elements.emplace_back(2.0f + static_cast<float>(i) / 64.0f);
  return Array(elements);
}

TEST(TagStreamDecoderTags, Text) {
  expectRead(readAsText, {8, 0, 0, 'c', 'a', 'b', 'c', 0, 'd', 0, 0, 0}, "abc");
}

TEST(TagStreamDecoderTags, Int32) { expectRead(readAsInt32, word, -2); }

TEST(TagStreamDecoderTags, Uint8) { expectRead(readAsUint8, word, 0xFE); }

TEST(TagStreamDecoderTags, Uint16) { expectRead(readAsUint16, word, 0xFFFE); }

TEST(TagStreamDecoderTags, Float) {
  expectRead(readAsFloat, {4, 0, 0, 'f', 0, 0, 0xC0, 0xBF}, -1.5f);
}

TEST(TagStreamDecoderTags, TwoFloats) {
  expectRead(readAs2Floats, floats(2), floatList(2));
  for (const int other : {0, 1, 3, 4}) expectIgnored(readAs2Floats, floats(other));
}

TEST(TagStreamDecoderTags, ThreeFloats) {
  expectRead(readAs3Floats, floats(3), floatList(3));
  for (const int other : {0, 2, 4}) expectIgnored(readAs3Floats, floats(other));
}

TEST(TagStreamDecoderTags, FourFloats) {
  expectRead(readAs4Floats, floats(4), floatList(4));
  for (const int other : {0, 3, 5}) expectIgnored(readAs4Floats, floats(other));
}

TEST(TagStreamDecoderTags, EightFloats) {
  expectRead(readAs8Floats, floats(8), floatList(8));
  for (const int other : {0, 7, 9}) expectIgnored(readAs8Floats, floats(other));
}

TEST(TagStreamDecoderTags, NineFloats) {
  expectRead(readAs9Floats, floats(9), floatList(9));
  for (const int other : {0, 8, 10}) expectIgnored(readAs9Floats, floats(other));
}

TEST(TagStreamDecoderTags, TwelveFloats) {
  expectRead(readAs12Floats, floats(12), floatList(12));
  for (const int other : {0, 11, 13}) expectIgnored(readAs12Floats, floats(other));
}

TEST(TagStreamDecoderTags, IntegerList) {
  expectRead(readAsIntegers, {8, 0, 0, 'H', 0xFE, 0xFF, 0xFF, 0xFF, 1, 2, 0, 0},
             Array::of(-2, 0x0201));
}

TEST(TagStreamDecoderTags, Data) {
  expectRead(readAsData, {5, 0, 0, 'c', 1, 0, 0xFF, 0, 5, 0, 0, 0},
             Value::data(Bytes{1, 0, 0xFF, 0, 5}));
}

TEST(TagStreamDecoderTags, Guid) {
  for (const std::string_view tag : readAsGuid) {
    myGUID guid;
    Bytes rest = {16, 0, 0, 'G'};
    rest.insert(rest.end(), 16, 0x42);
    EXPECT_EQ(decoded(recordOf(tag, rest), std::nullopt, &guid),
              (Dictionary{{tag, Value::data(Bytes(16, 0x42))}}));
    EXPECT_EQ(guid.Data1 & 0xFFFFFFFF, 0x42424242u);
    EXPECT_EQ(guid.Data2, 0x4242);
  }
}

TEST(TagStreamDecoderTags, Nested) {
  expectRead(readAsNested, {12, 0, 0, 0, 'T', 'A', 'K', 'E', 4, 0, 0, 'B', 3, 0, 0, 0},
             Dictionary{{"TAKE", 3}});
  expectIgnored(readAsNested, {0, 0, 0, 0});
}

TEST(TagStreamDecoderTags, RepeatedText) {
  expectRead(readAsTexts, {5, 0, 0, 'c', 'a', 'b', 0, 'd', 0, 0, 0, 0}, Array::of("ab\0d\0"sv));
}

TEST(TagStreamDecoderTags, RepeatedInteger) { expectRead(readAsInts, word, Array::of(-2)); }

TEST(TagStreamDecoderTags, RepeatedNested) {
  expectRead(readAsNestedList, {12, 0, 0, 0, 'T', 'A', 'K', 'E', 4, 0, 0, 'B', 3, 0, 0, 0},
             Array::of(Dictionary{{"TAKE", 3}}));
}

TEST(TagStreamDecoderTags, ControlPoint) {
  expectRead(readAsControlPoint, {20,  0,   0,   0,   0xFE, 0xFF, 0xFF, 0xFF, 1, 2, 0, 0,  //
                                  'T', 'A', 'K', 'E', 4,    0,    0,    'B',  3, 0, 0, 0},
             Array::of(Dictionary{{"TAKE", 3}, {"CTLPData", Array::of(-2, 0x0201)}}));
}

TEST(TagStreamDecoderTags, Groups) {
  const Bytes name = {4, 0, 0, 'c', 'N', 'a', 'm', 'e'};
  const auto pair = [&](std::string_view nameTag, std::string_view valueTag) {
    return StreamBuilder().raw(recordOf(nameTag, name)).raw(recordOf(valueTag, word)).bytes();
  };
  EXPECT_EQ(decoded(pair(readAsTagName[0], readAsTagValue[0])),
            (Dictionary{{"TAG ", Dictionary{{"Name", -2}}}}));
  EXPECT_EQ(decoded(pair(readAsRegName[0], readAsRegValue[0])),
            (Dictionary{{"REG ", Dictionary{{"Name", -2}}}}));
}

TEST(TagStreamDecoderTags, NeverRead) {
  expectIgnored(neverRead, word);
  expectIgnored(neverRead, {8, 0, 0, 'c', 'a', 'b', 'c', 0, 'd', 0, 0, 0});
}

std::set<std::string_view> allThatAreRead() {
  std::set<std::string_view> tags;
  const auto add = [&](const auto& rule) { tags.insert(std::begin(rule), std::end(rule)); };
  add(readAsText), add(readAsInt32), add(readAsUint8), add(readAsUint16), add(readAsFloat);
  add(readAs2Floats), add(readAs3Floats), add(readAs4Floats), add(readAs8Floats);
  add(readAs9Floats), add(readAs12Floats), add(readAsIntegers), add(readAsData), add(readAsGuid);
  add(readAsNested), add(readAsTexts), add(readAsInts), add(readAsNestedList);
  add(readAsControlPoint), add(readAsTagName), add(readAsTagValue), add(readAsRegName);
  add(readAsRegValue);
  return tags;
}

TEST(TagStreamDecoderTags, TheRulesHave203TagsInAll) {
  EXPECT_EQ(allThatAreRead().size(), 203u);
  for (const TagRow& row : tagRows()) {
    const std::array<char, 4> characters = charactersOf(row.tag);
    const std::string_view tag(characters.data(), characters.size());
    EXPECT_EQ(row.read != Read::none, allThatAreRead().contains(tag)) << tag;
  }
}

// The tag alone says how a record is read: the type may be any byte.
TEST(TagStreamDecoderTags, TypeMakesNoDifferenceOutsideTheGroups) {
  for (const std::string_view tag : allThatAreRead()) {
    if (tag == "TAGV" || tag == "REGV") continue;
    Bytes record =
        recordOf(tag, {16, 0, 0, 0, 1, 2, 3, 4, 'R', 'E', 'E', 'L', 4, 0, 0, 0, 'a', 'b', 'c', 0});
    const Dictionary expected = decoded(record);
    for (int type = 1; type <= 0xFF; ++type) {
      record[7] = static_cast<std::uint8_t>(type);
      EXPECT_EQ(decoded(record), expected) << tag << " of type " << type;
    }
  }
}

}  // namespace
}  // namespace oxmv::test
