// The entries of values, to go through.

#include <concepts>
#include <optional>
#include <string>
#include <type_traits>
#include <utility>
#include <vector>

#include <gtest/gtest.h>

#include "oxmv/values/Array.h"
#include "oxmv/values/Dictionary.h"
#include "tests/support/Decoding.h"
#include "tests/support/Printing.h"

namespace oxmv::test {
namespace {

using Pairs = std::vector<std::pair<std::string, Value>>;

Pairs entriesOf(const Value& value) {
  Pairs entries;
  for (const auto& [key, entry] : value.entries()) entries.emplace_back(key, entry);
  EXPECT_EQ(value.entries().size(), entries.size());
  EXPECT_EQ(value.entries().empty(), entries.empty());
  return entries;
}

// COL1 with REEL and LOOK in it.
Dictionary decodedClip() {
  return decoded({'C', 'O', 'L', '1', 24, 0, 0, 0,                      //
                  'R', 'E', 'E', 'L', 4,  0, 0, 'c', 'A', '1', 0,   0,  //
                  'L', 'O', 'O', 'K', 4,  0, 0, 'c', 'w', 'a', 'r', 'm'});
}

TEST(Entries, AreThoseOfTheDictionary) {
  EXPECT_EQ(entriesOf(Dictionary{{"b", 1}, {"a", "text"}}), (Pairs{{"b", 1}, {"a", "text"}}));
  EXPECT_EQ(entriesOf(Dictionary()), Pairs());
}

TEST(Entries, OfADecodedValueAreThoseOfItsStream) {
  const Value value = decodedClip()["COL1"];
  EXPECT_EQ(entriesOf(value), (Pairs{{"REEL", "A1"}, {"LOOK", "warm"}}));
}

TEST(Entries, AreNoneOfOtherKinds) {
  for (const Value& value :
       {Value(), Value(1), Value(1.5f), Value("text"), Value::data({}), Value(Array::of(1))})
    EXPECT_EQ(entriesOf(value), Pairs());
}

TEST(Entries, PassOverThoseThatWereRemoved) {
  Dictionary dictionary{{"a", 1}, {"b", 2}, {"c", 3}};
  dictionary.remove("a");
  dictionary.remove("c");
  EXPECT_EQ(entriesOf(dictionary), (Pairs{{"b", 2}}));
}

TEST(Entries, OfATemporaryAreADictionary) {
  std::string texts;
  for (const auto& [key, value] : decodedClip()["COL1"].entries()) texts += key;
  EXPECT_EQ(texts, "REELLOOK");
  const Dictionary dictionary = Value(Dictionary{{"a", 1}}).entries();
  EXPECT_EQ(dictionary, (Dictionary{{"a", 1}}));
}

TEST(Entries, WhatIsKeptOfThemOutlivesTheValue) {
  std::optional<Value> value = Dictionary{{"outer", decodedClip()}};
  std::vector<Value> kept;
  std::vector<Dictionary> dictionaries;
  for (const auto& [key, outer] : value->entries()) {
    for (const auto& [innerKey, inner] : outer.entries()) {
      kept.push_back(inner);
      dictionaries.push_back(inner.dictionary());
      for (const auto& [lastKey, last] : inner.entries()) kept.push_back(last);
    }
  }
  value.reset();
  const Dictionary color{{"REEL", "A1"}, {"LOOK", "warm"}};
  EXPECT_EQ(kept, (std::vector<Value>{color, "A1", "warm"}));
  EXPECT_EQ(dictionaries, std::vector{color});
}

// What is kept of a dictionary that somebody goes through is theirs alone to change.
TEST(Entries, AreNotChangedThroughACopyOfTheirValue) {
  const Value value = Dictionary{{"a", 1}, {"b", 2}};
  Pairs entries;
  Dictionary copy = value.dictionary();
  for (const auto& [key, entry] : value.entries()) {
    copy.remove(key);
    copy.set("new", 3);
    entries.emplace_back(key, entry);
  }
  EXPECT_EQ(entries, (Pairs{{"a", 1}, {"b", 2}}));
  EXPECT_EQ(copy, (Dictionary{{"new", 3}}));
}

static_assert(!std::copy_constructible<Entries> && !std::is_copy_assignable_v<Entries>,
              "a view stays where its value is");

}  // namespace
}  // namespace oxmv::test
