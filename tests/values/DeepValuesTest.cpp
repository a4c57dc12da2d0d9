// Values that a host nests in one another, deeper than any stack.

#include <cstdlib>
#include <limits>

#include <gtest/gtest.h>

#include "oxmv/metadata/TagStreamEncoder.h"
#include "oxmv/values/Array.h"
#include "oxmv/values/Dictionary.h"
#include "oxmv/values/Value.h"
#include "tests/support/Memory.h"
#include "tests/support/Printing.h"

namespace oxmv::test {
namespace {

constexpr int deep = 1'000'000;

Value nestedArrays(int levels) {
  Value value(1);
  for (int i = 0; i < levels; ++i) value = Array::of(value);
  return value;
}

Value nestedDictionaries(int levels) {
  Value value(1);
  for (int i = 0; i < levels; ++i) value = Dictionary{{"COL1", value}};
  return value;
}

TEST(DeepValues, EndWithoutAStackFrameForEachLevel) {
  const MemoryMeter meter;
  {
    const Value arrays = nestedArrays(deep);
    const Value dictionaries = nestedDictionaries(deep);
    EXPECT_EQ(arrays.array().size(), 1u);
    EXPECT_EQ(dictionaries.dictionary().size(), 1u);
    EXPECT_GT(meter.held(), 2u * deep * sizeof(Value));
  }
  EXPECT_EQ(meter.held(), 0u);
}

TEST(DeepValues, EndFromTheInsideOut) {
  const MemoryMeter meter;
  {
    Value value = nestedDictionaries(deep);
    // Every level loses its only owner while the next is looked at.
    int levels = 0;
    for (; value.kind() == Value::Kind::dictionary; ++levels) value = value.dictionary()["COL1"];
    EXPECT_EQ(levels, deep);
    EXPECT_EQ(value, Value(1));
  }
  EXPECT_EQ(meter.held(), 0u);
}

TEST(DeepValues, AreEncodedAsFarAsStreamsNest) {
  const auto stream = encodeStream(nestedDictionaries(deep).dictionary());
  ASSERT_TRUE(stream);
  EXPECT_EQ(stream->size(), 63u * 8u);
}

// In a process of its own: it ends, or runs out of stack.
TEST(DeepValues, AreCompared) {
  EXPECT_EXIT(
      {
        const bool isEqual = nestedDictionaries(deep) == nestedDictionaries(deep) &&
                             nestedArrays(deep) == nestedArrays(deep);
        std::_Exit(isEqual ? 0 : 1);
      },
      testing::ExitedWithCode(0), "");
}

// Values that stand in many places.

// Each level holds the one within it twice; `leaf` is the innermost.
Dictionary doubledDictionaries(int levels, const Value& leaf) {
  Dictionary dictionary{{"leaf", leaf}};
  for (int level = 0; level < levels; ++level) {
    const Dictionary inner = dictionary;
    dictionary.set("COL1", inner);
    dictionary.set("COL2", inner);
  }
  return dictionary;
}

Value doubledArrays(int levels, const Value& leaf) {
  Value value = leaf;
  for (int level = 0; level < levels; ++level) value = Array::of(value, value);
  return value;
}

// The same tree, every second level of which is made twice: either the even ones (0) or the odd
// ones (1), so that in two of them no level stands in many places of both.
Value halfDoubledArrays(int levels, int madeTwice) {
  Value first(1), second(1);
  for (int level = 0; level < levels; ++level) {
    const Value one = Array::of(first, second);
    const Value other = level % 2 == madeTwice ? Value(Array::of(first, second)) : one;
    first = one;
    second = other;
  }
  return Array::of(first, second);
}

TEST(SharedValues, EqualOthersMadeApart) {
  EXPECT_TRUE(doubledDictionaries(40, 1) == doubledDictionaries(40, 1));
  EXPECT_TRUE(doubledArrays(40, 1) == doubledArrays(40, 1));
  EXPECT_TRUE(halfDoubledArrays(80, 0) == halfDoubledArrays(80, 1));
}

TEST(SharedValues, DifferWhereTheirInnermostDo) {
  EXPECT_FALSE(doubledDictionaries(40, 1) == doubledDictionaries(40, 2));
  EXPECT_FALSE(doubledArrays(40, 1) == doubledArrays(40, 2));
  EXPECT_FALSE(doubledDictionaries(40, 1) == doubledDictionaries(41, 1));
  EXPECT_FALSE(doubledArrays(40, 1) == doubledArrays(39, 1));
}

TEST(SharedValues, EqualThemselvesWithoutALookInside) {
  const Value value = doubledDictionaries(40, std::numeric_limits<float>::quiet_NaN());
  const Value copy = value;
  EXPECT_TRUE(value == copy);
}

}  // namespace
}  // namespace oxmv::test
