// How a value under every tag is written, rule by rule.

#include <iterator>
#include <set>
#include <string_view>
#include <vector>

#include <gtest/gtest.h>

#include "oxmv/metadata/TagTable.h"
#include "oxmv/values/Array.h"
#include "tests/metadata/TagRules.h"
#include "tests/support/Encoding.h"
#include "tests/support/Printing.h"
#include "tests/support/StreamBuilder.h"

namespace oxmv::test {
namespace {

using namespace std::string_view_literals;

// Expects that `value` under each tag gives one record: the tag, and then `rest` byte for byte.
template <std::size_t count>
void expectWritten(const std::string_view (&tags)[count], const Value& value, const Bytes& rest) {
  for (const std::string_view tag : tags) {
    const Bytes expected = StreamBuilder().raw(bytesOf(tag)).raw(rest).bytes();
    for (const Layout layout : {Layout::exact, Layout::readable})
      EXPECT_EQ(encoded(Dictionary{{tag, value}}, layout), expected) << tag;
  }
}

template <std::size_t count>
void expectDropped(const std::string_view (&tags)[count], const Value& value) {
  for (const std::string_view tag : tags)
    EXPECT_EQ(encoded(Dictionary{{tag, value}}), Bytes()) << tag;
}

// Its low 8 bits, low 16 bits and 32 bits differ.
constexpr int number = -0x01020304;  // 0xFEFDFCFC

Array floatList(int count) {
  std::vector<Value> elements;
  for (int i = 0; i < count; ++i) elements.emplace_back(2.0f + static_cast<float>(i) / 64.0f);
  return Array(elements);
}

Bytes floats(int count) {
  Bytes rest = {static_cast<std::uint8_t>(4 * count), 0, 0, 'f'};
  for (int i = 0; i < count; ++i) {
    // 2.0f is 00 00 00 40; each step in the third byte adds a 64th.
    rest.insert(rest.end(), {0, 0, static_cast<std::uint8_t>(i), 0x40});
  }
  return rest;
}

TEST(TagStreamEncoderTags, Text) {
  expectWritten(writtenAsText, "ABCD", {8, 0, 0, 'c', 'A', 'B', 'C', 'D', 0, 0, 0, 0});
}

TEST(TagStreamEncoderTags, Float) {
  expectWritten(writtenAsFloat, -1.5f, {4, 0, 0, 'f', 0, 0, 0xC0, 0xBF});
}

TEST(TagStreamEncoderTags, IntegerH) {
  expectWritten(writtenAsIntegerH, number, {4, 0, 0, 'H', 0xFC, 0xFC, 0xFD, 0xFE});
}

TEST(TagStreamEncoderTags, IntegerL) {
  expectWritten(writtenAsIntegerL, number, {4, 0, 0, 'L', 0xFC, 0xFC, 0xFD, 0xFE});
}

TEST(TagStreamEncoderTags, IntegerR) {
  expectWritten(writtenAsIntegerR, number, {4, 0, 0, 'R', 0xFC, 0xFC, 0xFD, 0xFE});
}

TEST(TagStreamEncoderTags, Word16) {
  expectWritten(writtenAsWord16, number, {4, 0, 0, 'B', 0xFC, 0xFC, 0, 0});
}

TEST(TagStreamEncoderTags, Byte8) {
  expectWritten(writtenAsByte8, number, {4, 0, 0, 'B', 0xFC, 0, 0, 0});
}

TEST(TagStreamEncoderTags, FourCC) {
  expectWritten(writtenAsFourCC, "ABCDE", {4, 0, 0, 'F', 'A', 'B', 'C', 'D'});
}

TEST(TagStreamEncoderTags, Guid) {
  Bytes rest = {16, 0, 0, 'G'};
  rest.insert(rest.end(), 16, 0x42);
  expectWritten(writtenAsGuid, Value::data(Bytes(16, 0x42)), rest);
}

TEST(TagStreamEncoderTags, Data) {
  expectWritten(writtenAsData, Value::data(Bytes{1, 0, 0xFF, 4}), {4, 0, 0, 'c', 1, 0, 0xFF, 4});
}

TEST(TagStreamEncoderTags, FloatPair) {
  expectWritten(writtenAsFloatPair, floatList(2), floats(2));
  expectWritten(writtenAsFloatPair, floatList(3), floats(3));
  for (const int other : {0, 1, 4}) expectDropped(writtenAsFloatPair, floatList(other));
}

TEST(TagStreamEncoderTags, ThreeFloats) {
  expectWritten(writtenAs3Floats, floatList(3), floats(3));
  for (const int other : {0, 2, 4}) expectDropped(writtenAs3Floats, floatList(other));
}

TEST(TagStreamEncoderTags, FourFloats) {
  expectWritten(writtenAs4Floats, floatList(4), floats(4));
  for (const int other : {0, 3, 5}) expectDropped(writtenAs4Floats, floatList(other));
}

TEST(TagStreamEncoderTags, EightFloats) {
  expectWritten(writtenAs8Floats, floatList(8), floats(8));
  for (const int other : {0, 3, 7, 9}) expectDropped(writtenAs8Floats, floatList(other));
}

TEST(TagStreamEncoderTags, NineFloats) {
  expectWritten(writtenAs9Floats, floatList(9), floats(9));
  for (const int other : {0, 3, 8, 10}) expectDropped(writtenAs9Floats, floatList(other));
}

TEST(TagStreamEncoderTags, TwelveFloats) {
  expectWritten(writtenAs12Floats, floatList(12), floats(12));
  for (const int other : {0, 3, 11, 13}) expectDropped(writtenAs12Floats, floatList(other));
}

TEST(TagStreamEncoderTags, IntegerArray) {
  expectWritten(writtenAsIntegerArray, Array::of(1, number),
                {8, 0, 0, 'H', 0xFC, 0xFC, 0xFD, 0xFE, 0, 0, 0, 0});
}

TEST(TagStreamEncoderTags, IntegerEach) {
  expectWritten(writtenAsIntegerEach, Array::of(number), {4, 0, 0, 'H', 0xFC, 0xFC, 0xFD, 0xFE});
}

TEST(TagStreamEncoderTags, TextEach) {
  expectWritten(writtenAsTextEach, Array::of("ABCDE"),
                {8, 0, 0, 'c', 'A', 'B', 'C', 'D', 'E', 0, 0, 0});
}

TEST(TagStreamEncoderTags, NestedEach) {
  expectWritten(writtenAsNestedEach, Array::of(Dictionary{{"TAKE", 3}}),
                {12, 0, 0, 0, 'T', 'A', 'K', 'E', 4, 0, 0, 'B', 3, 0, 0, 0});
}

TEST(TagStreamEncoderTags, Nested) {
  constexpr std::string_view tags[] = {"COL1", "COL2"};
  expectWritten(tags, Dictionary{{"TAKE", 3}},
                {12, 0, 0, 0, 'T', 'A', 'K', 'E', 4, 0, 0, 'B', 3, 0, 0, 0});
}

TEST(TagStreamEncoderTags, ControlPoint) {
  constexpr std::string_view tags[] = {"CTLp"};
  expectWritten(tags, Array::of(Dictionary{{"TAKE", 3}, {"CTLPData", Array::of(number, 0x0201)}}),
                {20,  0,   0,   0,   0xFC, 0xFC, 0xFD, 0xFE, 1, 2, 0, 0,  //
                 'T', 'A', 'K', 'E', 4,    0,    0,    'B',  3, 0, 0, 0,  //
                 0,   0,   0,   0,   0,    0,    0,    0});
}

TEST(TagStreamEncoderTags, Leading) {
  constexpr std::string_view integers[] = {"PRCS", "UFRM"};
  expectWritten(integers, number, {4, 0, 0, 'L', 0xFC, 0xFC, 0xFD, 0xFE});
  constexpr std::string_view timecode[] = {"TIMC"};
  expectWritten(timecode, "ABCD", {4, 0, 0, 'c', 'A', 'B', 'C', 'D'});
}

TEST(TagStreamEncoderTags, NeverWritten) {
  for (const Value& value :
       {Value(number), Value(1.5f), Value("ABCD"), Value::data(Bytes{1, 2, 3, 4}),
        Value(floatList(3)), Value(Dictionary{{"TAKE", 3}})}) {
    expectDropped(neverWritten, value);
  }
}

TEST(TagStreamEncoderTags, EveryRowHasARuleAboveOrNone) {
  std::set<std::string_view> tags = {"PRCS", "UFRM", "TIMC"};
  const auto add = [&](const auto& rule) { tags.insert(std::begin(rule), std::end(rule)); };
  add(writtenAsText), add(writtenAsFloat), add(writtenAsIntegerH), add(writtenAsIntegerL);
  add(writtenAsIntegerR), add(writtenAsWord16), add(writtenAsByte8), add(writtenAsFourCC);
  add(writtenAsGuid), add(writtenAsData), add(writtenAsFloatPair), add(writtenAs3Floats);
  add(writtenAs4Floats), add(writtenAs8Floats), add(writtenAs9Floats), add(writtenAs12Floats);
  add(writtenAsIntegerArray), add(writtenAsIntegerEach), add(writtenAsTextEach);
  add(writtenAsNestedEach), add(writtenAsGroup), add(writtenDeferred);
  EXPECT_EQ(tags.size(), 203u);
  for (const TagRow& row : tagRows()) {
    const std::array<char, 4> characters = charactersOf(row.tag);
    const std::string_view tag(characters.data(), characters.size());
    EXPECT_EQ(row.write != Write::none, tags.contains(tag)) << tag;
  }
}

}  // namespace
}  // namespace oxmv::test
