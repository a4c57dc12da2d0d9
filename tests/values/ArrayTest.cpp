#include <bit>
#include <iterator>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include <gtest/gtest.h>

#include "oxmv/values/Array.h"
#include "oxmv/values/Dictionary.h"
#include "tests/support/Decoding.h"
#include "tests/support/Printing.h"

namespace oxmv::test {
namespace {

TEST(Array, IsEmptyByDefault) {
  const Array array;
  EXPECT_TRUE(array.empty());
  EXPECT_EQ(array.size(), 0u);
  EXPECT_TRUE(array.begin() == array.end());
}

TEST(Array, KeepsItsElementsInOrder) {
  const Array array = Array::of(3, "two", 1.5f, Array::of(1), Dictionary{{"k", 2}});
  ASSERT_EQ(array.size(), 5u);
  EXPECT_FALSE(array.empty());
  EXPECT_EQ(array[0], Value(3));
  EXPECT_EQ(array[1], Value("two"));
  EXPECT_EQ(array[2], Value(1.5f));
  EXPECT_EQ(array[3], Value(Array::of(1)));
  EXPECT_EQ(array[4], Value(Dictionary{{"k", 2}}));
}

TEST(Array, IteratesOverAllElements) {
  std::vector<int> numbers;
  for (const Value& value : Array::of(3, 1, 2)) numbers.push_back(value.intValue());
  EXPECT_EQ(numbers, (std::vector{3, 1, 2}));

  const Array array = Array::of(3, 1);
  auto place = array.begin();
  EXPECT_EQ(*place++, Value(3));
  EXPECT_EQ(*place, Value(1));
  EXPECT_TRUE(++place == array.end());
  const Array other = array;
  EXPECT_FALSE(other.end() == place);
}

static_assert(std::input_iterator<Array::Iterator>);

// The elements of an array of each of its forms, kept beyond it in one way of each sort; the ways
// are the same for dictionaries, whose tests have all of them.
void expectToBeKept(std::optional<Array> array, const std::vector<Value>& elements) {
  std::vector<Value> copied, moved, nameless;
  for (const Value& element : *array) copied.push_back(element);
  for (auto element : *array) moved.push_back(std::move(element));
  for (auto at = array->begin(); at != array->end();) {
    const Value& element = *at++;
    nameless.push_back(element);
  }
  const std::vector<Value> range(array->begin(), array->end());
  array.reset();
  EXPECT_EQ(copied, elements);
  EXPECT_EQ(moved, elements);
  EXPECT_EQ(nameless, elements);
  EXPECT_EQ(range, elements);
}

TEST(Array, WhatIsKeptFromALoopOutlivesTheArray) {
  expectToBeKept(Array::of(3, "two", Array::of("three")), {3, "two", Array::of("three")});
  expectToBeKept(decoded({'K', 'W', 'R', 'd', 4, 0, 0, 'c', 'n', 'o', 'o', 'n',  //
                          'K', 'W', 'R', 'd', 4, 0, 0, 'c', 'C', 'a', 'f', 0xE9})["KWRd"]
                     .array(),
                 {"noon", "Caf\xC3\xA9"});
  expectToBeKept(decoded({'D', 'S', 'P', 'm', 12, 0, 0, 0,  //
                          'R', 'E', 'E', 'L', 4,  0, 0, 'c', 'A', '1', 0, 0})["DSPm"]
                     .array(),
                 {Dictionary{{"REEL", "A1"}}});
  expectToBeKept(
      decoded({'D', 'A', 'S', 'F', 8, 0, 0, 'f', 0, 0, 0x80, 0x3F, 0, 0, 0, 0x40})["DASF"].array(),
      {1.0f, 2.0f});
  expectToBeKept(
      decoded({'B', 'A', 'D', 'P', 8, 0, 0, 'H', 5, 0, 0, 0, 0xFF, 0xFF, 0xFF, 0xFF})["BADP"]
          .array(),
      {5, -1});
}

TEST(Array, OfFloatsEqualsOneOfItsValues) {
  const float signalling = std::bit_cast<float>(0x7F800001u);
  const Array array = Array::of(1.5f, -0.0f, std::bit_cast<float>(0x7FC12345u));
  EXPECT_EQ(array, Array({Value(1.5f), Value(-0.0f), Value(std::bit_cast<float>(0x7FC12345u))}));
  EXPECT_EQ(array[0].kind(), Value::Kind::float32);
  EXPECT_EQ(Array::of(signalling)[0].floatBits(), Value(signalling).floatBits());
  EXPECT_EQ(Array::of(1.5f, 2)[1].kind(), Value::Kind::integer);
}

TEST(Array, OfAnArrayHoldsThatArray) {
  const Array inner = Array::of(1, 2);
  EXPECT_EQ(Array::of(inner).size(), 1u);
  EXPECT_EQ(Array(inner).size(), 2u);
}

TEST(Array, MayHoldNothing) {
  const Array array(std::vector<Value>{Value(), Value(1)});
  ASSERT_EQ(array.size(), 2u);
  EXPECT_TRUE(array[0].isNothing());
}

TEST(Array, CopyOutlivesTheOriginal) {
  Array copy;
  {
    const Array original = Array::of("a text long enough to be on the heap, wherever it is kept");
    copy = original;
  }
  EXPECT_EQ(copy[0].text(), "a text long enough to be on the heap, wherever it is kept");
}

TEST(Array, EqualsOneOfTheSameElementsInTheSameOrder) {
  EXPECT_EQ(Array::of(1, 2), Array::of(1, 2));
  EXPECT_EQ(Array(), Array(std::vector<Value>()));
  EXPECT_FALSE(Array::of(1, 2) == Array::of(2, 1));
  EXPECT_FALSE(Array::of(1, 2) == Array::of(1));
  EXPECT_FALSE(Array::of(1) == Array::of(1, 2));
  EXPECT_FALSE(Array::of(1) == Array());
}

}  // namespace
}  // namespace oxmv::test
