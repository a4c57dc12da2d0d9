#include <array>
#include <bit>
#include <limits>
#include <string>
#include <string_view>
#include <type_traits>
#include <utility>
#include <vector>

#include <gtest/gtest.h>

#include "oxmv/values/Array.h"
#include "oxmv/values/Dictionary.h"
#include "oxmv/values/Value.h"
#include "tests/support/Printing.h"
#include "tests/support/WideLong.h"

namespace oxmv::test {
namespace {

using namespace std::string_view_literals;
using Kind = Value::Kind;

constexpr float floatInfinity = std::numeric_limits<float>::infinity();
constexpr float floatNaN = std::numeric_limits<float>::quiet_NaN();
constexpr std::int32_t int32Min = std::numeric_limits<std::int32_t>::min();
constexpr std::int32_t int32Max = std::numeric_limits<std::int32_t>::max();
constexpr std::int64_t int64Min = std::numeric_limits<std::int64_t>::min();
constexpr std::int64_t int64Max = std::numeric_limits<std::int64_t>::max();

constexpr std::array<std::uint8_t, 3> someBytes = {0, 0xFF, 0x41};

// What has no place in a dictionary does not compile, neither do conversions that would come about
// by accident: a pointer is not true.
static_assert(!std::is_constructible_v<Value, bool>);
static_assert(!std::is_constructible_v<Value, char>);
static_assert(!std::is_constructible_v<Value, std::uint64_t>, "may not fit");
static_assert(!std::is_constructible_v<Value, const int*>);
static_assert(!std::is_constructible_v<Value, const std::uint8_t*>);
static_assert(!std::is_constructible_v<Value, const void*>);
static_assert(std::is_constructible_v<Value, std::int8_t>);
static_assert(std::is_constructible_v<Value, std::uint8_t>);
static_assert(std::is_constructible_v<Value, std::uint32_t>);
static_assert(std::is_constructible_v<Value, long>);
static_assert(std::is_constructible_v<Value, long long>);
static_assert(std::is_nothrow_copy_constructible_v<Value>);
static_assert(std::is_nothrow_move_constructible_v<Value>);

// Views are handed out by values that have a name only; a temporary hands out a copy.
static_assert(std::is_same_v<decltype(std::declval<const Value&>().text()), std::string_view>);
static_assert(std::is_same_v<decltype(std::declval<Value>().text()), std::string>);
static_assert(
    std::is_same_v<decltype(std::declval<const Value&>().data()), std::span<const std::uint8_t>>);
static_assert(std::is_same_v<decltype(std::declval<Value>().data()), std::vector<std::uint8_t>>);

TEST(Value, HasTheKindItWasMadeOf) {
  EXPECT_EQ(Value().kind(), Kind::nothing);
  EXPECT_EQ(Value(1).kind(), Kind::integer);
  EXPECT_EQ(Value(1.0f).kind(), Kind::float32);
  EXPECT_EQ(Value(1.0).kind(), Kind::float64);
  EXPECT_EQ(Value("1").kind(), Kind::text);
  EXPECT_EQ(Value(std::string("1")).kind(), Kind::text);
  EXPECT_EQ(Value("1"sv).kind(), Kind::text);
  EXPECT_EQ(Value::derivedText("1").kind(), Kind::text);
  EXPECT_EQ(Value::data(someBytes).kind(), Kind::data);
  EXPECT_EQ(Value(Array::of(1)).kind(), Kind::array);
  EXPECT_EQ(Value(Dictionary{{"A", 1}}).kind(), Kind::dictionary);
}

TEST(Value, KeepsItsKindWhenEmpty) {
  EXPECT_EQ(Value("").kind(), Kind::text);
  EXPECT_EQ(Value::derivedText("").kind(), Kind::text);
  EXPECT_EQ(Value::data({}).kind(), Kind::data);
  EXPECT_EQ(Value(Array()).kind(), Kind::array);
  EXPECT_EQ(Value(Dictionary()).kind(), Kind::dictionary);
}

TEST(Value, OnlyTheDefaultIsNothing) {
  EXPECT_TRUE(Value().isNothing());
  for (const Value& value : {Value(0), Value(0.0f), Value(0.0), Value(""), Value::derivedText(""),
                             Value::data({}), Value(Array()), Value(Dictionary())}) {
    EXPECT_FALSE(value.isNothing()) << testing::PrintToString(value);
  }
}

TEST(Value, NumbersAreIntegersFloatsAndDoubles) {
  for (const Value& number : {Value(0), Value(0.0f), Value(0.0)}) EXPECT_TRUE(number.isNumber());
  for (const Value& other : {Value(), Value("1"), Value::derivedText("1"), Value::data(someBytes),
                             Value(Array::of(1)), Value(Dictionary{{"A", 1}})}) {
    EXPECT_FALSE(other.isNumber()) << testing::PrintToString(other);
  }
}

TEST(Value, TellsDerivedTextFromOtherText) {
  EXPECT_TRUE(Value("a").isText());
  EXPECT_TRUE(Value::derivedText("a").isText());
  EXPECT_TRUE(Value::derivedText("a").isDerivedText());
  EXPECT_TRUE(Value::derivedText("").isDerivedText());
  EXPECT_FALSE(Value("a").isDerivedText());
  EXPECT_FALSE(Value("").isDerivedText());
  EXPECT_FALSE(Value(1).isText());
  EXPECT_FALSE(Value::data(someBytes).isText());
}

// Numbers of every kind.

TEST(Value, IntegerGivesItsLow32Bits) {
  EXPECT_EQ(Value(-5).intValue(), -5);
  EXPECT_EQ(Value(int32Min).intValue(), int32Min);
  EXPECT_EQ(Value(0xFFFFFFFFu).intValue(), -1);
  EXPECT_EQ(Value(0x1'0000'0007LL).intValue(), 7);
  EXPECT_EQ(Value(0x0'8000'0000LL).intValue(), int32Min);
  EXPECT_EQ(Value(int64Min).intValue(), 0);
  EXPECT_EQ(Value(int64Max).intValue(), -1);
}

TEST(Value, IntegerKeepsAll64Bits) {
  EXPECT_EQ(Value(int64Min).int64Value(), int64Min);
  EXPECT_EQ(Value(int64Max).int64Value(), int64Max);
  EXPECT_EQ(Value(0xFFFFFFFFu).int64Value(), 0xFFFFFFFFLL);
  EXPECT_EQ(Value(std::uint8_t{200}).int64Value(), 200);
  EXPECT_EQ(Value(std::int8_t{-100}).int64Value(), -100);
}

TEST(Value, IntegersAreTheSameWhereTheyNeedMoreThan32Bits) {
  for (const std::int64_t number : {std::int64_t{int32Min} - 1, std::int64_t{int32Min},
                                    -(std::int64_t{int32Min} + 1), -std::int64_t{int32Min}}) {
    const Value value(number);
    EXPECT_EQ(value.kind(), Value::Kind::integer) << number;
    EXPECT_TRUE(value.isNumber()) << number;
    EXPECT_EQ(value.int64Value(), number);
    EXPECT_EQ(value.doubleValue(), static_cast<double>(number));
    EXPECT_EQ(value.floatValue(), static_cast<float>(number));
    EXPECT_EQ(value, Value(number));
    EXPECT_NE(value, Value(number ^ std::int64_t{1} << 32)) << number;
    EXPECT_EQ(Value(value).int64Value(), number) << "a copy";
    EXPECT_EQ(Array::of(value)[0].int64Value(), number) << "an element";
  }
}

TEST(Value, IntegerAsFloatIsTheNearest) {
  EXPECT_EQ(Value(-3).floatValue(), -3.0f);
  EXPECT_EQ(Value(16'777'217).floatValue(), 16'777'216.0f);  // 2^24 + 1 has no float
  EXPECT_EQ(Value(int64Max).floatValue(), 9223372036854775808.0f);
  EXPECT_EQ(Value(-3).doubleValue(), -3.0);
  EXPECT_EQ(Value(16'777'217).doubleValue(), 16'777'217.0);
}

TEST(Value, FloatsTruncateTowardZero) {
  EXPECT_EQ(Value(2.9f).intValue(), 2);
  EXPECT_EQ(Value(-2.9f).intValue(), -2);
  EXPECT_EQ(Value(2.9).intValue(), 2);
  EXPECT_EQ(Value(-2.9).intValue(), -2);
  EXPECT_EQ(Value(-0.9f).intValue(), 0);
  EXPECT_EQ(Value(2.9f).int64Value(), 2);
  EXPECT_EQ(Value(-2.9).int64Value(), -2);
}

TEST(Value, FloatsSaturateAt32Bits) {
  EXPECT_EQ(Value(2147483647.0).intValue(), int32Max);
  EXPECT_EQ(Value(2147483646.5).intValue(), 2147483646);
  EXPECT_EQ(Value(2147483648.0f).intValue(), int32Max);
  EXPECT_EQ(Value(3e9f).intValue(), int32Max);
  EXPECT_EQ(Value(-2147483648.0f).intValue(), int32Min);
  EXPECT_EQ(Value(-2147483648.9).intValue(), int32Min);
  EXPECT_EQ(Value(-3e9).intValue(), int32Min);
  EXPECT_EQ(Value(floatInfinity).intValue(), int32Max);
  EXPECT_EQ(Value(-floatInfinity).intValue(), int32Min);
}

TEST(Value, FloatsSaturateAt64Bits) {
  EXPECT_EQ(Value(9223372036854774784.0).int64Value(), 9223372036854774784);  // the last below 2^63
  EXPECT_EQ(Value(9223372036854775808.0).int64Value(), int64Max);
  EXPECT_EQ(Value(-9223372036854775808.0).int64Value(), int64Min);
  EXPECT_EQ(Value(1e30f).int64Value(), int64Max);
  EXPECT_EQ(Value(-1e300).int64Value(), int64Min);
}

TEST(Value, NotANumberIsTheInteger0) {
  EXPECT_EQ(Value(floatNaN).intValue(), 0);
  EXPECT_EQ(Value(floatNaN).int64Value(), 0);
  EXPECT_EQ(Value(std::numeric_limits<double>::quiet_NaN()).intValue(), 0);
}

TEST(Value, FloatKeepsItsBits) {
  for (const std::uint32_t bits : {0x7FC00000u, 0xFFC00001u, 0x80000000u, 1u}) {
    const Value number = std::bit_cast<float>(bits);
    EXPECT_EQ(number.floatBits(), bits);
    EXPECT_EQ(std::bit_cast<std::uint32_t>(number.floatValue()), bits);
  }
}

TEST(Value, SignallingNotANumberKeepsItsBits) {
  if (!is64Bit) GTEST_SKIP() << "x87 registers may be how floats are handed over";
  EXPECT_EQ(Value(std::bit_cast<float>(0x7F800001u)).floatBits(), 0x7F800001u);
}

TEST(Value, FloatBitsAreThoseOfTheFloatValue) {
  EXPECT_EQ(Value(1).floatBits(), 0x3F800000u);
  EXPECT_EQ(Value(0.5).floatBits(), 0x3F000000u);
  EXPECT_EQ(Value("-1").floatBits(), 0xBF800000u);
  EXPECT_EQ(Value().floatBits(), 0u);
}

TEST(Value, DoubleAsFloatIsTheNearest) {
  EXPECT_EQ(Value(0.1).floatValue(), 0.1f);
  EXPECT_EQ(Value(1e300).floatValue(), floatInfinity);
  EXPECT_EQ(Value(1e-300).floatValue(), 0.0f);
  EXPECT_EQ(Value(0.1).doubleValue(), 0.1);
}

TEST(Value, TextIsReadLikeANumberAtItsStart) {
  const Value text(" \t\n\v\f\r-12.75e1 frames");
  EXPECT_EQ(text.intValue(), -12);
  EXPECT_EQ(text.int64Value(), -12);
  EXPECT_EQ(text.floatValue(), -127.5f);
  EXPECT_EQ(text.doubleValue(), -127.5);
  EXPECT_EQ(Value::derivedText("12abc").intValue(), 12);
}

TEST(Value, TextWithoutANumberIs0) {
  for (const char* text :
       {"", "abc", "-", "+", " ", "--1", "+-1", "- 1", "e5", ".", "inf", "nan", "infinity",
        "\xC2\xA0"
        "1"}) {
    EXPECT_EQ(Value(text).intValue(), 0) << text;
    EXPECT_EQ(Value(text).int64Value(), 0) << text;
    EXPECT_EQ(Value(text).floatValue(), 0.0f) << text;
    EXPECT_EQ(Value(text).doubleValue(), 0.0) << text;
  }
}

TEST(Value, TextNumbersSaturate) {
  EXPECT_EQ(Value("2147483647").intValue(), int32Max);
  EXPECT_EQ(Value("2147483648").intValue(), int32Max);
  EXPECT_EQ(Value("-2147483648").intValue(), int32Min);
  EXPECT_EQ(Value("-2147483649").intValue(), int32Min);
  EXPECT_EQ(Value("99999999999999999999999").intValue(), int32Max);
  EXPECT_EQ(Value("99999999999999999999999").int64Value(), int64Max);
  EXPECT_EQ(Value("-99999999999999999999999").int64Value(), int64Min);
}

TEST(Value, EveryOtherKindIsTheNumber0) {
  for (const Value& value : {Value(), Value::data(someBytes), Value(Array::of(7, 8)),
                             Value(Dictionary{{"REEL", 7}}), Value(Array()), Value(Dictionary())}) {
    EXPECT_EQ(value.intValue(), 0) << testing::PrintToString(value);
    EXPECT_EQ(value.int64Value(), 0) << testing::PrintToString(value);
    EXPECT_EQ(value.floatValue(), 0.0f) << testing::PrintToString(value);
    EXPECT_EQ(value.doubleValue(), 0.0) << testing::PrintToString(value);
  }
}

// Text.

TEST(Value, TextKeepsItsCharacters) {
  EXPECT_EQ(Value("Harbour, wide").text(), "Harbour, wide");
  EXPECT_EQ(Value::derivedText("Harbour, wide").text(), "Harbour, wide");
  EXPECT_EQ(Value("a\0b\0"sv).text(), "a\0b\0"sv);
  EXPECT_EQ(Value("").text(), "");
}

TEST(Value, TextThatIsNotUtf8IsReadAsLatin1) {
  EXPECT_EQ(Value("Caf\xE9").text(), "Caf\xC3\xA9");
  EXPECT_EQ(Value::derivedText("Caf\xE9").text(), "Caf\xC3\xA9");
  EXPECT_TRUE(Value::derivedText("Caf\xE9").isDerivedText());
  EXPECT_EQ(Value("Caf\xC3\xA9").text(), "Caf\xC3\xA9");
  // One bad byte makes the whole text another: no character is guessed.
  EXPECT_EQ(Value("\xC3\xA9\xFF").text(), "\xC3\x83\xC2\xA9\xC3\xBF");
}

// In a block a text is looked at several bytes at a time, whatever follows it.

Value textIn(const std::string& bytes, std::size_t size, detail::Form form) {
  const auto block = detail::Block::make({}, bytes, {}, {});
  return Value::in(*block, detail::Slot::place(form, static_cast<std::uint32_t>(size), 0));
}

TEST(Value, TextInABlockHasEveryLength) {
  for (std::size_t size = 0; size <= 100; ++size) {
    const std::string bytes(size, 'x');
    for (const std::string_view behind : {""sv, "y"sv, "\xFF"sv, "\0"sv}) {
      const std::string all = bytes + std::string(behind);
      EXPECT_EQ(textIn(all, size, detail::Form::text).text(), bytes) << size;
      EXPECT_EQ(textIn(all, size, detail::Form::textToNul).text(), bytes) << size;
    }
  }
}

TEST(Value, TextInABlockEndsAtItsFirstNulOrGoesOn) {
  for (std::size_t nul = 0; nul < 69; ++nul) {
    std::string bytes(70, 'x');
    bytes[nul] = '\0';
    bytes[69] = '\0';
    EXPECT_EQ(textIn(bytes, 70, detail::Form::textToNul).text(), bytes.substr(0, nul));
    EXPECT_EQ(textIn(bytes, 70, detail::Form::text).text(), bytes);
    bytes[69] = '\xE9';
    EXPECT_EQ(textIn(bytes, 70, detail::Form::textToNul), Value(bytes.substr(0, nul)));
    EXPECT_EQ(textIn(bytes, 70, detail::Form::text), Value(bytes));
  }
}

TEST(Value, TextInABlockIsUtf8WhereverItsLettersAre) {
  for (std::size_t place = 0; place < 70; ++place) {
    std::string bytes(72, 'x');
    bytes.replace(place, 2, "\xC3\xA9");
    EXPECT_EQ(textIn(bytes, 72, detail::Form::textToNul).text(), bytes);
    bytes[place + 1] = 'x';  // what is left is ISO-8859-1
    const std::string converted = bytes.substr(0, place) + "\xC3\x83" + bytes.substr(place + 1);
    EXPECT_EQ(textIn(bytes, 72, detail::Form::textToNul).text(), converted);
    EXPECT_EQ(textIn(bytes, 72, detail::Form::text).text(), converted);
  }
}

TEST(Value, LengthCountsUtf16Units) {
  EXPECT_EQ(Value("").length(), 0u);
  EXPECT_EQ(Value("REEL").length(), 4u);
  EXPECT_EQ(Value("Caf\xC3\xA9").length(), 4u);
  EXPECT_EQ(Value("\xE2\x82\xAC").length(), 1u);       // euro sign
  EXPECT_EQ(Value("\xF0\x9F\x8E\xAC!").length(), 3u);  // a clapper board is a surrogate pair
  EXPECT_EQ(Value("a\0b"sv).length(), 3u);
}

TEST(Value, OtherKindsHaveNoText) {
  for (const Value& value : {Value(), Value(65), Value(1.5f), Value(1.5), Value::data(someBytes),
                             Value(Array::of("a")), Value(Dictionary{{"a", "b"}})}) {
    EXPECT_EQ(value.text(), "") << testing::PrintToString(value);
    EXPECT_EQ(value.length(), 0u) << testing::PrintToString(value);
  }
}

TEST(Value, TemporaryHandsOutACopyOfItsText) {
  const auto text = Dictionary{{"REEL", "A001"}}["REEL"].text();
  EXPECT_EQ(text, "A001");
}

// Data.

TEST(Value, DataKeepsItsBytes) {
  const Value value = Value::data(someBytes);
  EXPECT_EQ(std::vector(value.data().begin(), value.data().end()),
            (std::vector<std::uint8_t>{0, 0xFF, 0x41}));
  EXPECT_EQ(Value::data(someBytes).data(), (std::vector<std::uint8_t>{0, 0xFF, 0x41}));
  EXPECT_EQ(Value::data({}).data(), std::vector<std::uint8_t>{});
}

TEST(Value, DataIsACopy) {
  std::vector<std::uint8_t> bytes = {1, 2, 3};
  const Value value = Value::data(bytes);
  bytes = {9, 9, 9};
  EXPECT_EQ(value, Value::data(std::array<std::uint8_t, 3>{1, 2, 3}));
}

TEST(Value, OtherKindsHaveNoData) {
  for (const Value& value :
       {Value(), Value(65), Value(1.5f), Value(1.5), Value("AB"), Value::derivedText("AB"),
        Value(Array::of(1)), Value(Dictionary{{"a", 1}})}) {
    EXPECT_TRUE(value.data().empty()) << testing::PrintToString(value);
  }
}

// Arrays and dictionaries.

TEST(Value, HandsOutItsArrayOrDictionary) {
  EXPECT_EQ(Value(Array::of(1, "two")).array(), Array::of(1, "two"));
  EXPECT_EQ(Value(Dictionary{{"one", 1}}).dictionary(), (Dictionary{{"one", 1}}));
}

TEST(Value, OtherKindsHaveNoArrayAndNoDictionary) {
  for (const Value& value : {Value(), Value(65), Value(1.5f), Value(1.5), Value("AB"),
                             Value::derivedText("AB"), Value::data(someBytes)}) {
    EXPECT_TRUE(value.array().empty()) << testing::PrintToString(value);
    EXPECT_TRUE(value.dictionary().empty()) << testing::PrintToString(value);
  }
  EXPECT_TRUE(Value(Array::of(1)).dictionary().empty());
  EXPECT_TRUE(Value(Dictionary{{"one", 1}}).array().empty());
}

TEST(Value, DictionaryChangedLaterLeavesItAlone) {
  Dictionary dictionary{{"REEL", "A001"}};
  const Value value(dictionary);
  dictionary.set("REEL", "B002");
  EXPECT_EQ(value.dictionary()["REEL"].text(), "A001");

  Dictionary takenOut = value.dictionary();
  takenOut.remove("REEL");
  EXPECT_EQ(value.dictionary()["REEL"].text(), "A001");
}

// Copies.

TEST(Value, CopyOutlivesTheOriginal) {
  Value copy;
  {
    const Value original("a text long enough to be on the heap, wherever a text is kept");
    copy = original;
  }
  EXPECT_EQ(copy.text(), "a text long enough to be on the heap, wherever a text is kept");
}

TEST(Value, MovedFromIsNothing) {
  Value original("a text");
  const Value moved(std::move(original));
  EXPECT_EQ(moved.text(), "a text");
  EXPECT_TRUE(original.isNothing());  // NOLINT(bugprone-use-after-move): that is what is tested
}

TEST(Value, SurvivesAssignmentToItself) {
  Value value("a text");
  const Value& same = value;
  value = same;
  EXPECT_EQ(value.text(), "a text");
}

// Equality.

TEST(Value, EqualsItsLikeAndNothingElse) {
  // Unequal to each other, all of them.
  const std::vector<Value> values = {Value(),
                                     Value(0),
                                     Value(1),
                                     Value(0x1'0000'0001LL),
                                     Value(1.0f),
                                     Value(0.0f),
                                     Value(-0.0f),
                                     Value(1.0),
                                     Value(0.0),
                                     Value(-0.0),
                                     Value(floatNaN),
                                     Value(""),
                                     Value("1"),
                                     Value("1\0"sv),
                                     Value::data({}),
                                     Value::data(std::array<std::uint8_t, 1>{'1'}),
                                     Value(Array()),
                                     Value(Array::of(1)),
                                     Value(Array::of(1, 1)),
                                     Value(Array::of(1.0f)),
                                     Value(Array::of(Array::of(1))),
                                     Value(Dictionary()),
                                     Value(Dictionary{{"1", 1}}),
                                     Value(Dictionary{{"1", 2}}),
                                     Value(Dictionary{{"2", 1}}),
                                     Value(Dictionary{{"1", 1}, {"2", 1}}),
                                     Value(Dictionary{{"1", Dictionary{{"1", 1}}}}),
                                     Value(Dictionary{{"1", Dictionary{{"1", 2}}}})};
  for (std::size_t i = 0; i < values.size(); ++i) {
    for (std::size_t k = 0; k < values.size(); ++k) {
      EXPECT_EQ(values[i] == values[k], i == k)
          << testing::PrintToString(values[i]) << " and " << testing::PrintToString(values[k]);
    }
  }
}

TEST(Value, EqualsWhatWasMadeApart) {
  const auto make = [] {
    return Value(Dictionary{{"n", 1},
                            {"f", 1.5f},
                            {"d", 2.5},
                            {"t", "text"},
                            {"b", Value::data(someBytes)},
                            {"a", Array::of(1, "x", Dictionary{{"k", floatNaN}})}});
  };
  EXPECT_EQ(make(), make());
}

TEST(Value, DerivedTextEqualsOtherTextOfTheSameCharacters) {
  EXPECT_EQ(Value::derivedText("Lens"), Value("Lens"));
  EXPECT_FALSE(Value::derivedText("Lens") == Value("lens"));
}

TEST(Value, NotANumberEqualsItselfBitForBit) {
  EXPECT_EQ(Value(std::bit_cast<float>(0x7FC00001u)), Value(std::bit_cast<float>(0x7FC00001u)));
  EXPECT_FALSE(Value(std::bit_cast<float>(0x7FC00001u)) ==
               Value(std::bit_cast<float>(0x7FC00002u)));
  const double nan = std::numeric_limits<double>::quiet_NaN();
  EXPECT_EQ(Value(nan), Value(nan));
}

}  // namespace
}  // namespace oxmv::test
