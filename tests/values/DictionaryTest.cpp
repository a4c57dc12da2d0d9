#include <array>
#include <bit>
#include <cstdint>
#include <string>
#include <string_view>
#include <thread>
#include <utility>
#include <vector>

#include <gtest/gtest.h>

#include "oxmv/values/Array.h"
#include "oxmv/values/Dictionary.h"
#include "tests/support/Decoding.h"
#include "tests/support/Printing.h"
#include "tests/support/StreamBuilder.h"

namespace oxmv::test {
namespace {

using namespace std::string_view_literals;

std::string numbered(int number) { return "key " + std::to_string(number); }

TEST(Dictionary, IsEmptyByDefault) {
  const Dictionary dictionary;
  EXPECT_TRUE(dictionary.empty());
  EXPECT_EQ(dictionary.size(), 0u);
  EXPECT_TRUE(dictionary.begin() == dictionary.end());
  EXPECT_FALSE(dictionary.contains("REEL"));
  EXPECT_TRUE(dictionary["REEL"].isNothing());
}

TEST(Dictionary, FindsWhatWasSet) {
  Dictionary dictionary;
  EXPECT_TRUE(dictionary.set("REEL", "A001"));
  EXPECT_TRUE(dictionary.set("TAKE", 2));
  EXPECT_EQ(dictionary.size(), 2u);
  EXPECT_FALSE(dictionary.empty());
  EXPECT_TRUE(dictionary.contains("REEL"));
  EXPECT_EQ(dictionary["REEL"], Value("A001"));
  EXPECT_EQ(dictionary["TAKE"], Value(2));
  EXPECT_FALSE(dictionary.contains("SHOT"));
  EXPECT_TRUE(dictionary["SHOT"].isNothing());
}

TEST(Dictionary, ComparesKeysByteForByte) {
  const Dictionary dictionary{{"REEL", 1}};
  for (const std::string_view other : {"reel"sv, "REE"sv, "REEL "sv, "REEL\0"sv, ""sv, "\0REE"sv})
    EXPECT_FALSE(dictionary.contains(other)) << other;
}

TEST(Dictionary, RefusesNothing) {
  Dictionary dictionary{{"REEL", "A001"}};
  EXPECT_FALSE(dictionary.set("TAKE", Value()));
  EXPECT_FALSE(dictionary.set("REEL", Value()));
  EXPECT_EQ(dictionary, (Dictionary{{"REEL", "A001"}}));
}

TEST(Dictionary, ListOfEntriesLeavesNothingOutAndTakesTheLastOfAKey) {
  const Dictionary dictionary{{"A", 1}, {"B", 2}, {"A", 3}, {"C", Value()}};
  EXPECT_EQ(keys(dictionary), (Names{"A", "B"}));
  EXPECT_EQ(dictionary["A"], Value(3));
}

// Order.

TEST(Dictionary, KeepsTheOrderOfFirstInsertion) {
  Dictionary dictionary;
  for (const char* key : {"b", "REEL", "", "a", "long key"}) dictionary.set(key, 1);
  EXPECT_EQ(keys(dictionary), (Names{"b", "REEL", "", "a", "long key"}));
}

TEST(Dictionary, ReplacedValueKeepsItsPlace) {
  Dictionary dictionary{{"A", 1}, {"B", 2}, {"C", 3}};
  EXPECT_TRUE(dictionary.set("A", "new"));
  EXPECT_EQ(keys(dictionary), (Names{"A", "B", "C"}));
  EXPECT_EQ(dictionary["A"], Value("new"));
  EXPECT_EQ(dictionary.size(), 3u);
}

TEST(Dictionary, KeyRemovedAndAddedAgainGoesToTheEnd) {
  Dictionary dictionary{{"A", 1}, {"B", 2}, {"C", 3}};
  EXPECT_TRUE(dictionary.remove("A"));
  EXPECT_TRUE(dictionary.set("A", 4));
  EXPECT_EQ(keys(dictionary), (Names{"B", "C", "A"}));
  EXPECT_EQ(dictionary["A"], Value(4));
}

TEST(Dictionary, RemovesWhatIsThereAndNothingElse) {
  Dictionary dictionary{{"A", 1}, {"B", 2}, {"C", 3}};
  EXPECT_FALSE(dictionary.remove("D"));
  EXPECT_TRUE(dictionary.remove("B"));
  EXPECT_FALSE(dictionary.remove("B"));
  EXPECT_FALSE(dictionary.contains("B"));
  EXPECT_TRUE(dictionary["B"].isNothing());
  EXPECT_EQ(keys(dictionary), (Names{"A", "C"}));
  EXPECT_EQ(dictionary.size(), 2u);

  EXPECT_TRUE(dictionary.remove("A"));
  EXPECT_TRUE(dictionary.remove("C"));
  EXPECT_TRUE(dictionary.empty());
  EXPECT_TRUE(dictionary.begin() == dictionary.end());
}

TEST(Dictionary, IteratesOverKeysAndValues) {
  const Dictionary dictionary{{"A", 1}, {"B", "two"}};
  auto place = dictionary.begin();
  EXPECT_EQ((*place).key, "A");
  EXPECT_EQ((*place++).value, Value(1));
  EXPECT_EQ((*place).key, "B");
  EXPECT_EQ((*place).value, Value("two"));
  EXPECT_TRUE(++place == dictionary.end());
}

TEST(Dictionary, IteratesPastRemovedPlacesAtBothEnds) {
  Dictionary dictionary{{"A", 1}, {"B", 2}, {"C", 3}, {"D", 4}, {"E", 5}};
  for (const char* key : {"A", "C", "E"}) dictionary.remove(key);
  EXPECT_EQ(keys(dictionary), (Names{"B", "D"}));
}

// Copies.

TEST(Dictionary, CopiesAreIndependentBothWays) {
  Dictionary original{{"A", 1}, {"B", 2}};
  Dictionary copy = original;
  copy.set("A", 10);
  copy.remove("B");
  copy.set("C", 30);
  EXPECT_EQ(original, (Dictionary{{"A", 1}, {"B", 2}}));
  original.set("A", 100);
  EXPECT_EQ(copy, (Dictionary{{"A", 10}, {"C", 30}}));
}

TEST(Dictionary, DecodedCopiesAreIndependentBothWays) {
  Dictionary original = decoded({'T', 'I', 'M', 'B', 4, 0, 0, 'B', 24, 0, 0, 0,  //
                                 'T', 'I', 'M', 'D', 4, 0, 0, 'B', 1,  0, 0, 0});
  Dictionary copy = original;
  copy.set("TIMB", 30);
  copy.set("TAKE", 3);
  EXPECT_EQ(original, (Dictionary{{"TIMB", 24}, {"TIMD", 1}}));
  original.remove("TIMD");
  EXPECT_EQ(copy, (Dictionary{{"TIMB", 30}, {"TIMD", 1}, {"TAKE", 3}}));
  EXPECT_EQ(keys(copy), (Names{"TIMB", "TIMD", "TAKE"}));
  EXPECT_EQ(original, (Dictionary{{"TIMB", 24}}));
}

TEST(Dictionary, MayHoldACopyOfItself) {
  Dictionary dictionary{{"A", 1}};
  dictionary.set("self", dictionary);
  dictionary.set("A", 2);
  EXPECT_EQ(dictionary, (Dictionary{{"A", 2}, {"self", Dictionary{{"A", 1}}}}));
}

TEST(Dictionary, ValueSetFromAnEntryOfItsOwn) {
  Dictionary dictionary{{"A", "a text long enough to be on the heap, wherever a text is kept"}};
  dictionary.set("B", dictionary["A"]);
  dictionary.remove("A");
  EXPECT_EQ(dictionary["B"].text(),
            "a text long enough to be on the heap, wherever a text is kept");
}

// A key handed out by a dictionary is valid until that dictionary is changed, so it is still valid
// when the change is asked for.
TEST(Dictionary, TakesAKeyThatItHandedOut) {
  const Bytes stream = {'T', 'I', 'M', 'B', 4, 0, 0, 'B', 24, 0, 0, 0,  //
                        'T', 'I', 'M', 'D', 4, 0, 0, 'B', 1,  0, 0, 0};
  Dictionary dictionary = decoded(stream);
  dictionary.set((*dictionary.begin()).key, 30);
  EXPECT_EQ(dictionary, (Dictionary{{"TIMB", 30}, {"TIMD", 1}}));

  dictionary = decoded(stream);
  EXPECT_TRUE(dictionary.remove((*dictionary.begin()).key));
  EXPECT_EQ(dictionary, (Dictionary{{"TIMD", 1}}));

  dictionary = Dictionary{{"a key of no tag", 1}, {"another", 2}};
  EXPECT_TRUE(dictionary.set((*dictionary.begin()).key, 3));
  EXPECT_TRUE(dictionary.remove((*dictionary.begin()).key));
  EXPECT_EQ(dictionary, (Dictionary{{"another", 2}}));
}

// Equality.

TEST(Dictionary, EqualsWhateverTheOrder) {
  EXPECT_EQ((Dictionary{{"A", 1}, {"B", 2}}), (Dictionary{{"B", 2}, {"A", 1}}));
  EXPECT_EQ(Dictionary(), Dictionary{});
  EXPECT_FALSE((Dictionary{{"A", 1}}) == (Dictionary{{"A", 2}}));
  EXPECT_FALSE((Dictionary{{"A", 1}}) == (Dictionary{{"B", 1}}));
  EXPECT_FALSE((Dictionary{{"A", 1}}) == (Dictionary{{"A", 1}, {"B", 2}}));
  EXPECT_FALSE((Dictionary{{"A", 1}, {"B", 2}}) == (Dictionary{{"A", 1}}));
}

TEST(Dictionary, EqualsOnceEmptiedAnEmptyOne) {
  Dictionary dictionary{{"A", 1}};
  dictionary.remove("A");
  EXPECT_EQ(dictionary, Dictionary());
  EXPECT_EQ(Dictionary(), dictionary);
}

TEST(Dictionary, DecodedEqualsOneMadeByHand) {
  EXPECT_EQ(decoded({'R', 'E', 'E', 'L', 4, 0, 0, 'c', 'A', '1', 0,    0,  //
                     'D', 'A', 'S', 'F', 8, 0, 0, 'f', 0,   0,   0x80, 0x3F, 0, 0, 0, 0x40}),
            (Dictionary{{"DASF", Array::of(1.0f, 2.0f)}, {"REEL", "A1"}}));
}

// Keys.

TEST(Dictionary, TakesKeysOfEveryLength) {
  Dictionary dictionary;
  for (std::size_t size = 0; size <= 300; ++size)
    dictionary.set(std::string(size, 'k'), static_cast<int>(size));
  ASSERT_EQ(dictionary.size(), 301u);
  for (std::size_t size = 0; size <= 300; ++size)
    EXPECT_EQ(dictionary[std::string(size, 'k')], Value(static_cast<int>(size)));
  EXPECT_FALSE(dictionary.contains(std::string(301, 'k')));
}

TEST(Dictionary, TakesKeysWithNulsAndOfOtherLetters) {
  const std::vector<std::string_view> names = {
      "\0\0\0\0"sv, "\0\0\0"sv,           "A\0\0\0"sv,         "A\0"sv,
      "A"sv,        "\xC3\xA9\xC3\xA9"sv, "\x7F\x7F\x7F\x7F"sv};
  Dictionary dictionary;
  for (const std::string_view name : names) dictionary.set(name, name);
  ASSERT_EQ(dictionary.size(), names.size());
  for (const std::string_view name : names) EXPECT_EQ(dictionary[name], Value(name));
}

TEST(Dictionary, KeyThatIsNotUtf8IsReadAsLatin1) {
  Dictionary dictionary;
  dictionary.set("Caf\xE9", 1);
  EXPECT_EQ(keys(dictionary), (Names{"Caf\xC3\xA9"}));
  EXPECT_EQ(dictionary["Caf\xE9"], Value(1));
  EXPECT_EQ(dictionary["Caf\xC3\xA9"], Value(1));
  dictionary.set("Caf\xC3\xA9", 2);
  EXPECT_EQ(dictionary.size(), 1u);
  EXPECT_TRUE(dictionary.remove("Caf\xE9"));
  EXPECT_TRUE(dictionary.empty());
}

TEST(Dictionary, DecodedFindsTheTagAtEveryPlaceAndNoOther) {
  const std::array<std::string_view, 20> tags = {
      "ACDL", "AFFI", "ATZM", "BMTX", "CACT", "CADN", "CALI", "CCRV", "CHFP", "CHNL",
      "CLSF", "CLSR", "CLSY", "CMIX", "CMVL", "CPUM", "CQUL", "CSWP", "CV67", "DCRV"};
  for (std::size_t count = 0; count < tags.size(); ++count) {
    StreamBuilder stream;
    for (std::size_t i = 0; i < count; ++i)
      stream.record(tags[i], 'H', static_cast<std::int32_t>(i));
    // The payload of the last is the tag that is not there, and stands where a search might go on.
    stream.record("DEMO", 'H', std::bit_cast<std::int32_t>(std::array{'I', 'G', 'N', 'R'}));
    const Dictionary dictionary = decoded(stream.bytes());
    for (std::size_t i = 0; i < count; ++i)
      EXPECT_EQ(dictionary[tags[i]], Value(static_cast<std::int32_t>(i))) << tags[i];
    for (std::size_t i = count; i < tags.size(); ++i)
      EXPECT_TRUE(dictionary[tags[i]].isNothing()) << tags[i];
    EXPECT_TRUE(dictionary["IGNR"].isNothing());
  }
}

// Threads.

TEST(Dictionary, ThreadsAtOnceReadCopyAndChangeTheirOwn) {
  StreamBuilder stream;
  for (int i = 0; i < 50; ++i)
    stream.record("REGN", 'c', numbered(i) + "\xE9").record("REGV", 'L', i);
  Dictionary made = decoded(stream.bytes());
  for (int i = 0; i < 50; ++i) made.set(numbered(i), "a text that all of them share");
  const Dictionary shared = made;

  std::vector<std::thread> threads;
  std::vector<Dictionary> results(4);
  for (std::size_t number = 0; number < results.size(); ++number) {
    threads.emplace_back([&shared, &result = results[number], number] {
      for (int i = 0; i < 50; ++i) {
        Dictionary own = shared;
        own.set("mine", static_cast<int>(number));
        own.remove(numbered(i));
        own.set(numbered(i), shared[numbered(49 - i)]);
        result = own;
      }
    });
  }
  for (std::thread& thread : threads) thread.join();
  for (std::size_t number = 0; number < results.size(); ++number) {
    Dictionary expected = shared;
    expected.set("mine", static_cast<int>(number));
    EXPECT_EQ(results[number], expected);
  }
}

}  // namespace
}  // namespace oxmv::test
