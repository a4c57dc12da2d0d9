#include <bit>
#include <limits>
#include <string>
#include <string_view>
#include <vector>

#include <gtest/gtest.h>

#include "oxmv/metadata/TagStreamEncoder.h"
#include "oxmv/values/Array.h"
#include "tests/support/Decoding.h"
#include "tests/support/Encoding.h"
#include "tests/support/Memory.h"
#include "tests/support/Printing.h"
#include "tests/support/StreamBuilder.h"

namespace oxmv::test {
namespace {

using namespace std::string_view_literals;

constexpr Layout bothLayouts[] = {Layout::exact, Layout::readable};

Value dataOf(const Bytes& bytes) { return Value::data(bytes); }

TEST(TagStreamEncoder, EmptyDictionaryGivesAnEmptyStream) {
  for (const Layout layout : bothLayouts) EXPECT_EQ(encoded(Dictionary(), layout), Bytes());
}

TEST(TagStreamEncoder, OneRecord) {
  for (const Layout layout : bothLayouts) {
    EXPECT_EQ(encoded(Dictionary{{"TAKE", 0x0102}}, layout),
              (Bytes{'T', 'A', 'K', 'E', 4, 0, 0, 'B', 2, 1, 0, 0}));
  }
}

// Order.

TEST(TagStreamEncoder, KeepsTheDictionarysOwnOrder) {
  EXPECT_EQ(tagsIn(encoded(Dictionary{{"TAKE", 1}, {"REEL", "A"}, {"ASCS", 1.0f}, {"BMTX", 1}})),
            (Names{"TAKE", "REEL", "ASCS", "BMTX"}));
  EXPECT_EQ(tagsIn(encoded(Dictionary{{"BMTX", 1}, {"ASCS", 1.0f}, {"REEL", "A"}, {"TAKE", 1}})),
            (Names{"BMTX", "ASCS", "REEL", "TAKE"}));
}

TEST(TagStreamEncoder, KeepsTheOrderOfADecodedStream) {
  StreamBuilder stream;
  stream.record("TAKE", 'B', 1).record("REEL", 'c', "A\0\0\0"sv).record("BMTX", 'L', 2);
  EXPECT_EQ(encoded(decoded(stream.bytes())), stream.bytes());
}

TEST(TagStreamEncoder, ProcessFrameAndTimecodeComeFirst) {
  EXPECT_EQ(encoded(Dictionary{{"TAKE", 3}, {"TIMC", "1:0"}, {"UFRM", 2}, {"PRCS", -1}}),
            (Bytes{'P', 'R', 'C', 'S', 4, 0, 0, 'L', 0xFF, 0xFF, 0xFF, 0xFF,  //
                   'U', 'F', 'R', 'M', 4, 0, 0, 'L', 2,    0,    0,    0,     //
                   'T', 'I', 'M', 'C', 4, 0, 0, 'c', '1',  ':',  '0',  0,     //
                   'T', 'A', 'K', 'E', 4, 0, 0, 'B', 3,    0,    0,    0}));
}

TEST(TagStreamEncoder, DeferredTagsComeLastInFixedOrder) {
  const Dictionary nested{{"TAKE", 1}};
  const Dictionary tags{{"CTLp", Array::of(nested)},
                        {"DTFO", 4},
                        {"DTFI", 3},
                        {"DTDR", 2},
                        {"DTIN", 1},
                        {"COL2", nested},
                        {"COL1", nested},
                        {"SHOT", 1},
                        {"DSPm", Array::of(nested)}};
  Names records = tagsIn(encoded(tags));
  ASSERT_EQ(records.back(), std::string(4, '\0')) << "the terminator of the control points";
  records.pop_back();
  EXPECT_EQ(records,
            (Names{"SHOT", "DSPm", "COL1", "COL2", "DTIN", "DTDR", "DTFI", "DTFO", "CTLp"}));
}

TEST(TagStreamEncoder, KeepsWritingBothOfAPair) {
  const Bytes pair = {'D', 'T', 'I', 'N', 4, 0, 0, 'L', 5, 0, 0, 0,  //
                      'D', 'T', 'D', 'R', 4, 0, 0, 'L', 0, 0, 0, 0};
  EXPECT_EQ(encoded(Dictionary{{"DTIN", 5}}), pair);
  EXPECT_EQ(encoded(Dictionary{{"DTDR", 5}}),
            (Bytes{'D', 'T', 'I', 'N', 4, 0, 0, 'L', 0, 0, 0, 0,  //
                   'D', 'T', 'D', 'R', 4, 0, 0, 'L', 5, 0, 0, 0}));
  EXPECT_EQ(encoded(Dictionary{{"DTFO", 6}}),
            (Bytes{'D', 'T', 'F', 'I', 4, 0, 0, 'L', 0, 0, 0, 0,  //
                   'D', 'T', 'F', 'O', 4, 0, 0, 'L', 6, 0, 0, 0}));
  EXPECT_EQ(encoded(Dictionary{{"DTFI", 6}}),
            (Bytes{'D', 'T', 'F', 'I', 4, 0, 0, 'L', 6, 0, 0, 0,  //
                   'D', 'T', 'F', 'O', 4, 0, 0, 'L', 0, 0, 0, 0}));
}

// Keys.

TEST(TagStreamEncoder, KeyThatIsNoTagIsDropped) {
  const Dictionary tags{{"ABCDE", 1}, {"AB", 1},        {"", 1},        {"TAKEN", 1},  {"take", 1},
                        {"ZZZZ", 1},  {"CTLPData", 1},  {"TAK\0"sv, 1}, {"MKGD", 1},   {"TAKE ", 1},
                        {"MDFR", 1},  {"TAGN", "x"},    {"TAGV", "x"},  {"REGN", "x"}, {"REGV", 1},
                        {"TAG", 1},   {"R\xC3\xA9L", 1}};
  for (const Layout layout : bothLayouts) EXPECT_EQ(encoded(tags, layout), Bytes());
}

// Numbers.

TEST(TagStreamEncoder, SmallNumbersKeepTheirLowBits) {
  EXPECT_EQ(encoded(Dictionary{{"GAIN", 70'000}}),  // 0x11170
            (Bytes{'G', 'A', 'I', 'N', 4, 0, 0, 'B', 0x70, 0x11, 0, 0}));
  EXPECT_EQ(encoded(Dictionary{{"GAIN", -1}}),
            (Bytes{'G', 'A', 'I', 'N', 4, 0, 0, 'B', 0xFF, 0xFF, 0, 0}));
  EXPECT_EQ(encoded(Dictionary{{"PROJ", 300}}),  // 0x12C
            (Bytes{'P', 'R', 'O', 'J', 4, 0, 0, 'B', 0x2C, 0, 0, 0}));
  EXPECT_EQ(encoded(Dictionary{{"PROJ", -1}}),
            (Bytes{'P', 'R', 'O', 'J', 4, 0, 0, 'B', 0xFF, 0, 0, 0}));
}

TEST(TagStreamEncoder, IntegersKeepTheirLow32Bits) {
  EXPECT_EQ(encoded(Dictionary{{"LCRC", 0xFEDCBA98u}}),
            (Bytes{'L', 'C', 'R', 'C', 4, 0, 0, 'H', 0x98, 0xBA, 0xDC, 0xFE}));
  EXPECT_EQ(encoded(Dictionary{{"LCRC", 0x7'0000'0001LL}}),
            (Bytes{'L', 'C', 'R', 'C', 4, 0, 0, 'H', 1, 0, 0, 0}));
}

TEST(TagStreamEncoder, FloatsKeepTheirBits) {
  for (const std::uint32_t bits : {0x7FC00001u, 0xFF800000u, 0x80000000u, 0x00000001u}) {
    const auto byte = [&](int i) { return static_cast<std::uint8_t>(bits >> 8 * i); };
    EXPECT_EQ(encoded(Dictionary{{"SATU", std::bit_cast<float>(bits)}}),
              (Bytes{'S', 'A', 'T', 'U', 4, 0, 0, 'f', byte(0), byte(1), byte(2), byte(3)}));
  }
}

// Values of another kind than the rule's: numbers take what the accessor answers.
TEST(TagStreamEncoder, NumberRulesTakeValuesOfEveryKind) {
  const auto integer = [](const Value& value) { return encoded(Dictionary{{"PIXR", value}}); };
  const auto pixelRatio = [](std::uint8_t low, std::uint8_t high) {
    return Bytes{'P', 'I', 'X', 'R', 4, 0, 0, 'R', low, high, high, high};
  };
  EXPECT_EQ(integer(-2.9f), pixelRatio(0xFE, 0xFF));
  EXPECT_EQ(integer(2.9), pixelRatio(2, 0));
  EXPECT_EQ(integer(" 12abc"), pixelRatio(12, 0));
  EXPECT_EQ(integer("abc"), pixelRatio(0, 0));
  EXPECT_EQ(integer(std::numeric_limits<float>::quiet_NaN()), pixelRatio(0, 0));
  EXPECT_EQ(integer(dataOf({1, 2, 3, 4})), pixelRatio(0, 0));
  EXPECT_EQ(integer(Array::of(7)), pixelRatio(0, 0));
  EXPECT_EQ(integer(Dictionary{{"PIXR", 7}}), pixelRatio(0, 0));

  const auto saturation = [](const Value& value) { return encoded(Dictionary{{"SATU", value}}); };
  EXPECT_EQ(saturation(2), (Bytes{'S', 'A', 'T', 'U', 4, 0, 0, 'f', 0, 0, 0, 0x40}));
  EXPECT_EQ(saturation(2.0), (Bytes{'S', 'A', 'T', 'U', 4, 0, 0, 'f', 0, 0, 0, 0x40}));
  EXPECT_EQ(saturation("-1.5x"), (Bytes{'S', 'A', 'T', 'U', 4, 0, 0, 'f', 0, 0, 0xC0, 0xBF}));
  EXPECT_EQ(saturation(Array::of(2)), (Bytes{'S', 'A', 'T', 'U', 4, 0, 0, 'f', 0, 0, 0, 0}));
}

TEST(TagStreamEncoder, LeadingNumbersTakeValuesOfEveryKind) {
  EXPECT_EQ(encoded(Dictionary{{"PRCS", 2.9}, {"UFRM", "x"}}),
            (Bytes{'P', 'R', 'C', 'S', 4, 0, 0, 'L', 2, 0, 0, 0,  //
                   'U', 'F', 'R', 'M', 4, 0, 0, 'L', 0, 0, 0, 0}));
}

TEST(TagStreamEncoder, OtherRulesWriteNothingForAnotherKind) {
  const std::vector<Value> kinds = {Value(7),
                                    Value(1.5f),
                                    Value(1.5),
                                    Value("text"),
                                    dataOf({1, 2, 3, 4}),
                                    Value(Array::of(1, 2, 3)),
                                    Value(Array::of(1, 2, 3, 4)),
                                    Value(Dictionary{{"TAKE", 1}})};
  const auto expectNothing = [&](const char* tag, auto isFitting) {
    for (const Value& value : kinds) {
      if (isFitting(value)) continue;
      for (const Layout layout : bothLayouts) {
        EXPECT_EQ(encoded(Dictionary{{tag, value}}, layout), Bytes())
            << tag << ' ' << testing::PrintToString(value);
      }
    }
  };
  const auto isKind = [](Value::Kind kind) {
    return [kind](const Value& value) { return value.kind() == kind; };
  };
  for (const char* tag : {"TIMC", "REEL"}) expectNothing(tag, isKind(Value::Kind::text));
  for (const char* tag : {"GUID", "FREE"}) expectNothing(tag, isKind(Value::Kind::data));
  for (const char* tag : {"BADP", "SCPg", "KWRd", "CTLp"})
    expectNothing(tag, isKind(Value::Kind::array));
  for (const char* tag : {"COL1", "COL2", "TAG ", "REG "})
    expectNothing(tag, isKind(Value::Kind::dictionary));
  // Arrays of no dictionaries hold no element that fits.
  expectNothing("DSPm", [](const Value&) { return false; });
  expectNothing("MASK", [](const Value&) { return false; });
  expectNothing("WBAL", [](const Value& value) { return value.array().size() == 4; });
  expectNothing("GAMT", [](const Value& value) { return value.array().size() == 3; });
  expectNothing("DASF", [](const Value& value) { return value.array().size() == 3; });
}

// Float lists.

TEST(TagStreamEncoder, WhiteBalanceOfThreeIsNotWritten) {
  EXPECT_EQ(encoded(Dictionary{{"WBAL", Array::of(1.0f, 2.0f, 3.0f)}}), Bytes());
}

TEST(TagStreamEncoder, KeepsPairOfThreeAsATriple) {
  for (const Layout layout : bothLayouts) {
    EXPECT_EQ(encoded(Dictionary{{"DASF", Array::of(1.0f, 2.0f, 3.0f)}}, layout),
              (Bytes{'D', 'A', 'S',  'F',  12, 0, 0, 'f',  //
                     0,   0,   0x80, 0x3F, 0,  0, 0, 0x40, 0, 0, 0x40, 0x40}));
  }
}

TEST(TagStreamEncoder, FloatListTakesItsElementsAsFloats) {
  EXPECT_EQ(encoded(Dictionary{{"WBAL", Array::of(1, "2.5", Array(), 0.5)}}),
            (Bytes{'W', 'B', 'A',  'L',  16, 0, 0,    'f',  //
                   0,   0,   0x80, 0x3F, 0,  0, 0x20, 0x40, 0, 0, 0, 0, 0, 0, 0, 0x3F}));
}

// Integers.

TEST(TagStreamEncoder, KeepsLastElementOfIntegerArrayInTheFirstWord) {
  for (const Layout layout : bothLayouts) {
    EXPECT_EQ(encoded(Dictionary{{"BADP", Array::of(1, 2, -3)}}, layout),
              (Bytes{'B',  'A',  'D',  'P',  12, 0, 0, 'H',  //
                     0xFD, 0xFF, 0xFF, 0xFF, 0,  0, 0, 0,   0, 0, 0, 0}));
  }
}

TEST(TagStreamEncoder, IntegerArrayOfOneOrNone) {
  EXPECT_EQ(encoded(Dictionary{{"SNID", Array::of(0x0201)}}),
            (Bytes{'S', 'N', 'I', 'D', 4, 0, 0, 'H', 1, 2, 0, 0}));
  EXPECT_EQ(encoded(Dictionary{{"SNID", Array()}}), (Bytes{'S', 'N', 'I', 'D', 0, 0, 0, 'H'}));
}

TEST(TagStreamEncoder, IntegerArrayTakesItsLastElementAsAnInteger) {
  EXPECT_EQ(encoded(Dictionary{{"SNID", Array::of(1, "7 of 9")}}),
            (Bytes{'S', 'N', 'I', 'D', 8, 0, 0, 'H', 7, 0, 0, 0, 0, 0, 0, 0}));
  EXPECT_EQ(encoded(Dictionary{{"SNID", Array::of(1, Array::of(2))}}),
            (Bytes{'S', 'N', 'I', 'D', 8, 0, 0, 'H', 0, 0, 0, 0, 0, 0, 0, 0}));
}

TEST(TagStreamEncoder, IntegerArrayIsWrittenWhileItsSizeHas24Bits) {
  const auto encodedOf = [](std::size_t count) {
    return encoded(Dictionary{{"GPST", Array(std::vector<Value>(count, Value(9)))}, {"TAKE", 1}});
  };
  const Bytes stream = encodedOf(0x3FFFFF);
  ASSERT_EQ(stream.size(), 8u + 0xFFFFFC + 12u);
  EXPECT_EQ(Bytes(stream.begin(), stream.begin() + 16),
            (Bytes{'G', 'P', 'S', 'T', 0xFC, 0xFF, 0xFF, 'H', 9, 0, 0, 0, 0, 0, 0, 0}));
  EXPECT_EQ(tagsIn(encodedOf(0x400000)), (Names{"TAKE"}));
}

TEST(TagStreamEncoder, IntegerArrayIsReadableWhileReadersStepOverIt) {
  const auto encodedOf = [](std::size_t count) {
    return encoded(Dictionary{{"GPST", Array(std::vector<Value>(count, Value(0)))}, {"TAKE", 1}},
                   Layout::readable);
  };
  const Bytes stream = encodedOf(0xFFFFF4 / 4);
  EXPECT_EQ(Bytes(stream.begin(), stream.begin() + 8),
            (Bytes{'G', 'P', 'S', 'T', 0xF4, 0xFF, 0xFF, 'H'}));
  EXPECT_EQ(keys(decoded(stream)), (Names{"GPST", "TAKE"}));
  EXPECT_EQ(tagsIn(encodedOf(0xFFFFF4 / 4 + 1)), (Names{"TAKE"}));
}

TEST(TagStreamEncoder, RepeatedIntegerIsARecordAnElement) {
  EXPECT_EQ(encoded(Dictionary{{"SCPg", Array::of(1, -2, "3x", Array())}}),
            (Bytes{'S', 'C', 'P', 'g', 4, 0, 0, 'H', 1,    0,    0,    0,     //
                   'S', 'C', 'P', 'g', 4, 0, 0, 'H', 0xFE, 0xFF, 0xFF, 0xFF,  //
                   'S', 'C', 'P', 'g', 4, 0, 0, 'H', 3,    0,    0,    0,     //
                   'S', 'C', 'P', 'g', 4, 0, 0, 'H', 0,    0,    0,    0}));
  EXPECT_EQ(encoded(Dictionary{{"SCPg", Array()}}), Bytes());
}

// Data.

TEST(TagStreamEncoder, KeepsRawDataUnpadded) {
  const Bytes stream = encoded(Dictionary{{"FREE", dataOf({1, 2, 3, 4, 5})}});
  EXPECT_EQ(stream, (Bytes{'F', 'R', 'E', 'E', 5, 0, 0, 'c', 1, 2, 3, 4, 5}));
  EXPECT_EQ(stream.size(), 13u);
  EXPECT_EQ(encoded(Dictionary{{"FREE", dataOf({1, 2, 3, 4, 5})}, {"TAKE", 6}}),
            (Bytes{'F', 'R', 'E', 'E', 5, 0, 0, 'c', 1, 2, 3, 4, 5,  //
                   'T', 'A', 'K', 'E', 4, 0, 0, 'B', 6, 0, 0, 0}));
}

TEST(TagStreamEncoder, ReadableRawDataArePadded) {
  EXPECT_EQ(encoded(Dictionary{{"FREE", dataOf({1, 2, 3, 4, 5})}}, Layout::readable),
            (Bytes{'F', 'R', 'E', 'E', 5, 0, 0, 'c', 1, 2, 3, 4, 5, 0, 0, 0}));
}

TEST(TagStreamEncoder, EmptyDataIsAHeader) {
  for (const Layout layout : bothLayouts) {
    EXPECT_EQ(encoded(Dictionary{{"NOPP", dataOf({})}}, layout),
              (Bytes{'N', 'O', 'P', 'P', 0, 0, 0, 'c'}));
  }
}

TEST(TagStreamEncoder, KeepsTheLow16BitsOfADataSize) {
  struct Case {
    std::size_t size;
    Bytes field;
  };
  for (const auto& [size, field] :
       {Case{65535, {0xFF, 0xFF, 0}}, Case{65536, {0, 0, 0}}, Case{65537, {1, 0, 0}}}) {
    const Bytes data(size, 0xAB);
    const Bytes stream = encoded(Dictionary{{"FREE", dataOf(data)}});
    EXPECT_EQ(stream, StreamBuilder().raw(bytesOf("FREE")).raw(field).raw({'c'}).raw(data).bytes())
        << size;
  }
}

TEST(TagStreamEncoder, ReadableDataSizeHas24Bits) {
  struct Case {
    std::size_t size;
    Bytes field;
    std::size_t padding;
  };
  for (const auto& [size, field, padding] :
       {Case{65535, {0xFF, 0xFF, 0}, 1}, Case{65536, {0, 0, 1}, 0}, Case{65537, {1, 0, 1}, 3}}) {
    const Bytes data(size, 0xAB);
    StreamBuilder expected;
    expected.raw(bytesOf("FREE")).raw(field).raw({'c'}).raw(data).raw(Bytes(padding, 0));
    const Bytes stream = encoded(Dictionary{{"FREE", dataOf(data)}}, Layout::readable);
    EXPECT_EQ(stream, expected.bytes()) << size;
  }
}

TEST(TagStreamEncoder, DataIsWrittenWhileItsSizeHas24Bits) {
  const Bytes stream = encoded(Dictionary{{"FREE", dataOf(Bytes(0xFFFFFF, 0xAB))}});
  EXPECT_EQ(stream.size(), 8u + 0xFFFFFF);
  EXPECT_EQ(Bytes(stream.begin(), stream.begin() + 9),
            (Bytes{'F', 'R', 'E', 'E', 0xFF, 0xFF, 0, 'c', 0xAB}));

  const Value tooLarge = dataOf(Bytes(0x1000000, 0xAB));
  for (const char* tag : {"FREE", "GUID"}) {
    EXPECT_EQ(encoded(Dictionary{{tag, tooLarge}, {"TAKE", 1}}),
              (Bytes{'T', 'A', 'K', 'E', 4, 0, 0, 'B', 1, 0, 0, 0}));
  }
}

// With one byte more the record's length would wrap, and what follows would not be read.
TEST(TagStreamEncoder, DataIsReadableWhileReadersStepOverIt) {
  const Dictionary largest{{"FREE", dataOf(Bytes(0xFFFFF4, 0xAB))}, {"TAKE", 1}};
  const Bytes stream = encoded(largest, Layout::readable);
  EXPECT_EQ(stream.size(), 8u + 0xFFFFF4 + 12u);
  EXPECT_EQ(Bytes(stream.begin(), stream.begin() + 9),
            (Bytes{'F', 'R', 'E', 'E', 0xF4, 0xFF, 0xFF, 'c', 0xAB}));
  EXPECT_TRUE(decoded(stream) == largest);

  for (const std::size_t size : {0xFFFFF5u, 0xFFFFFFu, 0x1000000u}) {
    for (const char* tag : {"FREE", "GUID"}) {
      EXPECT_EQ(
          encoded(Dictionary{{tag, dataOf(Bytes(size, 0xAB))}, {"TAKE", 1}}, Layout::readable),
          (Bytes{'T', 'A', 'K', 'E', 4, 0, 0, 'B', 1, 0, 0, 0}));
    }
  }
}

// The identity.

TEST(TagStreamEncoder, KeepsSize16OfEveryGuid) {
  for (const std::size_t size : {0u, 5u, 16u, 24u}) {
    const Bytes image(size, 0x42);
    EXPECT_EQ(encoded(Dictionary{{"GUID", dataOf(image)}}),
              StreamBuilder().header("GUID", 16, 'G').raw(image).bytes())
        << size;
  }
}

TEST(TagStreamEncoder, ReadableGuidHasItsTrueSize) {
  EXPECT_EQ(encoded(Dictionary{{"GUID", dataOf({1, 2, 3, 4, 5})}}, Layout::readable),
            (Bytes{'G', 'U', 'I', 'D', 5, 0, 0, 'G', 1, 2, 3, 4, 5, 0, 0, 0}));
  const Bytes image(24, 0x42);
  EXPECT_EQ(encoded(Dictionary{{"GUID", dataOf(image)}}, Layout::readable),
            StreamBuilder().header("GUID", 24, 'G').raw(image).bytes());
}

// Codes of four characters.

TEST(TagStreamEncoder, FourCharacterCodeIsFilledWithZerosAndCut) {
  const auto code = [](const Value& value) { return encoded(Dictionary{{"DTAG", value}}); };
  EXPECT_EQ(code("ABCD"), (Bytes{'D', 'T', 'A', 'G', 4, 0, 0, 'F', 'A', 'B', 'C', 'D'}));
  EXPECT_EQ(code("ABCDE"), (Bytes{'D', 'T', 'A', 'G', 4, 0, 0, 'F', 'A', 'B', 'C', 'D'}));
  EXPECT_EQ(code("AB"), (Bytes{'D', 'T', 'A', 'G', 4, 0, 0, 'F', 'A', 'B', 0, 0}));
  EXPECT_EQ(code(""), (Bytes{'D', 'T', 'A', 'G', 4, 0, 0, 'F', 0, 0, 0, 0}));
  EXPECT_EQ(code("ABCD\xC3\xA9"), (Bytes{'D', 'T', 'A', 'G', 4, 0, 0, 'F', 'A', 'B', 'C', 'D'}))
      << "what is cut need not be ASCII";
  EXPECT_EQ(code("ABC\xC3\xA9"), (Bytes{'D', 'T', 'A', 'G', 4, 0, 0, 'F', 0, 0, 0, 0}));
}

TEST(TagStreamEncoder, FourCharacterCodeOfAnotherKindIsZeros) {
  const Bytes zeros = {'D', 'T', 'A', 'G', 4, 0, 0, 'F', 0, 0, 0, 0};
  for (const Value& value : {Value(0x41424344), Value(1.5f), dataOf({'A', 'B', 'C', 'D'}),
                             Value(Array::of("ABCD")), Value(Dictionary{{"DTAG", "ABCD"}})}) {
    EXPECT_EQ(encoded(Dictionary{{"DTAG", value}}), zeros) << testing::PrintToString(value);
  }
}

TEST(TagStreamEncoder, KeepsTagsWithoutAWayBack) {
  // Written, and read by nobody.
  const Bytes stream = {'G', 'H', 'T', 'L', 4, 0, 0, 'H', 5, 0, 0, 0,  //
                        'G', 'H', 'T', 'R', 4, 0, 0, 'H', 6, 0, 0, 0};
  EXPECT_EQ(encoded(Dictionary{{"GHTL", 5}, {"GHTR", 6}}), stream);
  EXPECT_EQ(decoded(stream), Dictionary());
}

// A stream whose sizes are all multiples of 4 reads back exactly.
TEST(TagStreamEncoder, WhatIsAlignedReadsBack) {
  const Dictionary tags{
      {"PRCS", 1},
      {"TIMC", "01:02:03:04"},
      {"REEL", "A001_C003"},
      {"SATU", 0.1f},
      {"WBAL", Array::of(1.0f, 1.2f, 1.05f, 1.5f)},
      {"FREE", dataOf({0, 1, 2, 3, 4, 5, 6, 7})},
      {"GUID", dataOf(Bytes(16, 9))},
      {"SCPg", Array::of(1, -2)},
      {"KWRd", Array::of("four", "eight888")},
      {"DSPm", Array::of(Dictionary{{"ZOOM", 2.0f}}, Dictionary())},
      {"TAG ", Dictionary{{"ISO", 400}, {"Lens", "35mm"}}},
      {"COL1", Dictionary{{"SATU", 0.5f}, {"COL2", Dictionary{{"TAKE", 1}}}}},
      {"CTLp", Array::of(Dictionary{{"ZOOM", 1.0f}, {"CTLPData", Array::of(3, 4)}})}};
  for (const Layout layout : bothLayouts) {
    const Dictionary back = decoded(encoded(tags, layout));
    EXPECT_EQ(back, tags);
    EXPECT_EQ(keys(back), keys(tags));
  }
}

TEST(TagStreamEncoder, ReadableStreamReadsBackWhateverItsSizes) {
  const Dictionary tags{
      {"FREE", dataOf({1, 2, 3, 4, 5})},
      {"DPXI", dataOf(Bytes(70'001, 6))},
      {"GUID", dataOf({1, 2, 3})},
      {"TAKE", 7},
      {"DSPm", Array::of(Dictionary{{"FREE", dataOf({1})}}, Dictionary{{"TAKE", 1}})},
      {"COL1", Dictionary{{"FREE", dataOf(Bytes(65'537, 8))}, {"TAKE", 9}}},
      {"CTLp",
       Array::of(Dictionary{{"FREE", dataOf({1, 2})}, {"TAKE", 3}, {"CTLPData", Array::of(3, 4)}},
                 Dictionary{{"CTLPData", Array::of(5, 6)}})}};
  EXPECT_EQ(decoded(encoded(tags, Layout::readable)), tags);
}

// No memory.

TEST(TagStreamEncoder, ShortageOfMemoryGivesNothing) {
  const Dictionary tags{{"REEL", "A001_C003"},
                        {"FREE", dataOf(Bytes(10'000, 7))},
                        {"COL1", Dictionary{{"TAKE", 1}}},
                        {"CTLp", Array::of(Dictionary{{"CTLPData", Array::of(3, 4)}})}};
  const Bytes expected = encoded(tags);
  std::size_t granted = 0;
  for (bool wasEnough = false; !wasEnough; ++granted) {
    ASSERT_LT(granted, 1000u);
    const MemoryMeter meter;
    bool wasFelt = false;
    std::optional<Bytes> stream;
    {
      const MemoryShortage shortage(granted);
      stream = encodeStream(tags);
      wasFelt = shortage.wasFelt();
    }
    EXPECT_EQ(stream.has_value(), !wasFelt) << granted;
    wasEnough = stream.has_value();
    if (wasEnough) {
      EXPECT_EQ(*stream, expected);
    } else {
      EXPECT_EQ(meter.held(), 0u) << granted;
    }
  }
  EXPECT_GT(granted, 1u) << "nothing was ever short";
}

}  // namespace
}  // namespace oxmv::test
