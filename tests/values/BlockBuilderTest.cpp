#include <algorithm>
#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

#include <gtest/gtest.h>

#include "oxmv/values/Array.h"
#include "oxmv/values/BlockBuilder.h"
#include "oxmv/values/Dictionary.h"
#include "tests/support/Decoding.h"
#include "tests/support/Memory.h"
#include "tests/support/Printing.h"
#include "tests/support/StreamBuilder.h"

namespace oxmv::test {
namespace {

using namespace std::string_literals;
using detail::BlockBuilder;
using detail::Form;
using detail::Key;
using detail::Scratch;
using detail::Slot;

Slot number(std::int32_t number) {
  return Slot::scalar(Form::integer, static_cast<std::uint32_t>(number));
}

Key keyOf(int id) { return Key::tag(std::to_string(1000 + id)); }

TEST(Scratch, KeepsItsItemsWhenItOutgrowsItself) {
  Scratch<std::uint32_t, 4> scratch;
  for (std::uint32_t i = 0; i < 1000; ++i) {
    scratch.push(i);
    ASSERT_EQ(scratch.size(), i + 1);
    ASSERT_EQ(scratch[0], 0u);
    ASSERT_EQ(scratch[i], i);
  }
  scratch.shrink(3);
  *scratch.extend(1) = 7;
  EXPECT_EQ(std::vector(scratch.from(1).begin(), scratch.from(1).end()),
            (std::vector<std::uint32_t>{1, 2, 7}));
}

TEST(Scratch, StartsAgainInItselfOnceItsHeapIsGivenBack) {
  Scratch<std::uint32_t, 4> scratch;
  for (std::uint32_t i = 0; i < 100; ++i) scratch.push(i);
  scratch.release();
  EXPECT_EQ(scratch.size(), 0u);
  for (std::uint32_t i = 0; i < 100; ++i) scratch.push(2 * i);
  EXPECT_EQ(scratch.size(), 100u);
  EXPECT_EQ(scratch[99], 198u);
}

TEST(BlockBuilder, LastValueOfAnIdWinsInTheFirstPlace) {
  BlockBuilder builder({});
  const auto outer = builder.open();
  builder.put(7, keyOf(7), number(1));
  builder.put(3, keyOf(3), number(2));
  builder.put(7, keyOf(7), number(3));
  const Slot root = builder.close(outer);
  const Dictionary made = Value::in(*builder.block(), root).dictionary();
  EXPECT_EQ(made, (Dictionary{{"1007", 3}, {"1003", 2}}));
  EXPECT_EQ(keys(made), (Names{"1007", "1003"}));
}

TEST(BlockBuilder, HoldsTheMostEntriesOfEachOfManyLevels) {
  BlockBuilder builder({});
  std::vector<BlockBuilder::Open> outer;
  constexpr int most = BlockBuilder::mostEntries;
  for (int level = 0; level < 64; ++level) {
    outer.push_back(builder.open());
    for (int id = 0; id < most - 1; ++id) builder.put(std::uint8_t(id), keyOf(id), number(level));
  }
  Slot made = builder.close(outer.back());
  for (int level = 62; level >= 0; --level) {
    outer.pop_back();
    builder.put(most - 1, Key::tag("next"), made);
    made = builder.close(outer.back());
  }
  Value dictionary = Value::in(*builder.block(), made);
  for (int level = 0; level < 64; ++level) {
    ASSERT_EQ(dictionary.dictionary().size(), std::size_t(level < 63 ? most : most - 1));
    ASSERT_EQ(dictionary.dictionary()[keyOf(0).tagText()], Value(level));
    ASSERT_EQ(dictionary.dictionary()[keyOf(most - 2).tagText()], Value(level));
    dictionary = dictionary.dictionary()["next"];
  }
}

TEST(BlockBuilder, ListsTakeTheirElementsFromBetweenOthers) {
  BlockBuilder builder({});
  const auto outer = builder.open();
  builder.append(1, keyOf(1), number(1));
  builder.append(2, keyOf(2), number(2));
  builder.put(3, keyOf(3), number(3));
  builder.append(1, keyOf(1), number(4));
  const auto inner = builder.open();
  builder.append(1, keyOf(1), number(5));
  const Slot nested = builder.close(inner);
  builder.append(2, keyOf(2), nested);
  builder.append(1, keyOf(1), number(6));
  const Slot root = builder.close(outer);
  EXPECT_EQ(Value::in(*builder.block(), root),
            Value(Dictionary{{"1001", Array::of(1, 4, 6)},
                             {"1002", Array::of(2, Dictionary{{"1001", Array::of(5)}})},
                             {"1003", 3}}));
}

TEST(BlockBuilder, GroupsOfEverySizeKeepFirstPlacesAndLastValues) {
  const Bytes bytes = bytesOf("aabbcacbccabcaaacbbbabcabacbcabcacbabcab");
  for (std::uint32_t count = 1; count + 1 < bytes.size(); ++count) {
    BlockBuilder builder(bytes);
    Dictionary expected, other;
    const auto outer = builder.open();
    for (std::uint32_t i = 0; i < count; ++i) {
      const Slot name = Slot::place(Form::text, 2, i);
      const std::string text(bytes.begin() + i, bytes.begin() + i + 2);
      const bool isOther = i % 5 == 4;
      builder.putNamed(isOther ? 2 : 1, keyOf(isOther ? 2 : 1), name, number(std::int32_t(i)));
      (isOther ? other : expected).set(text, static_cast<std::int32_t>(i));
    }
    const Slot root = builder.close(outer);
    const Dictionary made = Value::in(*builder.block(), root).dictionary();
    ASSERT_EQ(made["1001"], Value(expected)) << count;
    ASSERT_EQ(keys(made["1001"].dictionary()), keys(expected)) << count;
    ASSERT_EQ(keys(made["1002"].dictionary()), keys(other)) << count;
  }
}

// Names are told apart by their first eight bytes where these differ.
TEST(BlockBuilder, ManyNamesThatBeginAlikeAreAllFound) {
  const std::string letters = "abcdefgh\0\0ij"s;
  const Bytes bytes = bytesOf(letters + letters + "\x7F\xC3\xA9");
  std::vector<Slot> names;
  for (std::uint32_t size = 0; size <= letters.size(); ++size) {
    names.push_back(Slot::place(Form::text, size, 0));
    if (size > 0) names.push_back(Slot::place(Form::text, size, 1));
  }
  names.push_back(Slot::place(Form::text, 1, 24));
  names.push_back(Slot::place(Form::text, 2, 25));

  BlockBuilder builder(bytes);
  Dictionary expected;
  const auto outer = builder.open();
  for (int round = 0; round < 2; ++round) {
    for (std::size_t i = 0; i < names.size(); ++i) {
      const auto value = static_cast<std::int32_t>(1000 * round + static_cast<int>(i));
      builder.putNamed(1, keyOf(1), names[i], number(value));
      expected.set({reinterpret_cast<const char*>(bytes.data()) + names[i].body(), names[i].size()},
                   value);
    }
  }
  const Slot root = builder.close(outer);
  const Dictionary made = Value::in(*builder.block(), root).dictionary()["1001"].dictionary();
  EXPECT_EQ(made.size(), names.size());
  EXPECT_EQ(keys(made), keys(expected));
  for (const auto& [key, value] : expected) EXPECT_EQ(made[key], value) << key;
}

TEST(BlockBuilder, NamesOfEveryLengthAreUtf8WhateverIsBehindThem) {
  for (std::uint32_t size = 1; size <= 70; ++size) {
    for (const std::size_t behind : {0u, 1u, 31u, 32u, 33u}) {
      Bytes bytes(size + behind, 'x');
      std::fill(bytes.begin() + size, bytes.end(), std::uint8_t{0xFF});
      const Slot name = Slot::place(Form::text, size, 0);
      EXPECT_EQ(BlockBuilder(bytes).asUtf8(name), name) << size << " and " << behind;
      for (const std::uint32_t place : {0u, size / 2, size - 1}) {
        bytes[place] = 0xE9;
        EXPECT_EQ(BlockBuilder(bytes).asUtf8(name).size(), size + 1) << size << " and " << behind;
        bytes[place] = 'x';
      }
    }
  }
}

TEST(BlockBuilder, TextThatIsNotUtf8IsConvertedBehindTheBytes) {
  const Bytes bytes = bytesOf("Caf\xE9");
  BlockBuilder builder(bytes);
  const auto outer = builder.open();
  const Slot name = builder.asUtf8(Slot::place(Form::text, 4, 0));
  EXPECT_EQ(name.body(), 4u);
  builder.putNamed(1, keyOf(1), name, number(1));
  EXPECT_EQ(builder.asUtf8(Slot::place(Form::text, 3, 0)).body(), 0u) << "needs no copy";
  const Slot root = builder.close(outer);
  EXPECT_EQ(Value::in(*builder.block(), root),
            Value(Dictionary{{"1001", Dictionary{{"Caf\xC3\xA9", 1}}}}));
}

// What was gathered of lists and groups is given back before there is a block.
TEST(BlockBuilder, MakesRoomForTheBlock) {
  constexpr std::uint32_t count = 1 << 14;  // a capacity, so that no room is left over
  Bytes bytes;
  for (std::uint32_t i = 0; i < count; ++i)
    for (const int shift : {12, 8, 4, 0})
      bytes.push_back(static_cast<std::uint8_t>('a' + (i >> shift & 0xF)));
  const MemoryMeter meter;
  BlockBuilder builder(bytes);
  const auto outer = builder.open();
  for (std::uint32_t i = 0; i < count; ++i) {
    builder.append(1, keyOf(1), number(1));
    builder.putNamed(2, keyOf(2), Slot::place(Form::text, 4, 4 * i), number(2));
  }
  const Slot root = builder.close(outer);
  const std::size_t before = meter.held();
  {
    const Dictionary made = Value::in(*builder.block(), root).dictionary();
    EXPECT_EQ(made["1001"].array().size(), std::size_t{count});
    EXPECT_EQ(made["1002"].dictionary().size(), std::size_t{count});
  }
  // The bytes of an element, of a name and value twice, of a place in the order by name.
  EXPECT_GE(before - meter.held(), std::size_t{count} * (12 + 2 * 24 + 12));
}

}  // namespace
}  // namespace oxmv::test
