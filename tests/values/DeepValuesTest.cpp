// Values that a host nests in one another, deeper than any stack.

#include <cstdlib>

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

}  // namespace
}  // namespace oxmv::test
