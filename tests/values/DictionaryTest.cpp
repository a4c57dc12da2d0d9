#include <array>
#include <bit>
#include <cstdint>
#include <functional>
#include <iterator>
#include <new>
#include <set>
#include <string>
#include <string_view>
#include <thread>
#include <utility>
#include <vector>

#include <gtest/gtest.h>

#include "oxmv/values/Array.h"
#include "oxmv/values/Dictionary.h"
#include "tests/support/CollidingNames.h"
#include "tests/support/Decoding.h"
#include "tests/support/Memory.h"
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
  const Dictionary other = dictionary;
  EXPECT_FALSE(other.end() == place);
}

TEST(Dictionary, IteratesPastRemovedPlacesAtBothEnds) {
  Dictionary dictionary{{"A", 1}, {"B", 2}, {"C", 3}, {"D", 4}, {"E", 5}};
  for (const char* key : {"A", "C", "E"}) dictionary.remove(key);
  EXPECT_EQ(keys(dictionary), (Names{"B", "D"}));
}

// What a loop lends, and how it is kept.

static_assert(std::input_iterator<Dictionary::Iterator>);

// A text of each kind of payload, one that is not UTF-8 among them, data, lists and a dictionary.
const Bytes ofEveryPayload = {'R', 'E', 'E', 'L',  4,  0, 0, 'c', 'A', '0', '1',  0,     //
                              'L', 'O', 'O', 'K',  4,  0, 0, 'c', 'C', 'a', 'f',  0xE9,  //
                              'F', 'R', 'E', 'E',  4,  0, 0, 'c', 1,   2,   3,    4,     //
                              'D', 'A', 'S', 'F',  8,  0, 0, 'f', 0,   0,   0x80, 0x3F,  //
                              0,   0,   0,   0x40,                                       //
                              'K', 'W', 'R', 'd',  4,  0, 0, 'c', 'n', 'o', 'o',  'n',   //
                              'K', 'W', 'R', 'd',  4,  0, 0, 'c', 'C', 'a', 'f',  0xE9,  //
                              'C', 'O', 'L', '1',  12, 0, 0, 0,                          //
                              'T', 'A', 'P', 'E',  4,  0, 0, 'c', 'B', '0', '2',  0,     //
                              'T', 'A', 'K', 'E',  4,  0, 0, 'B', 7,   0,   0,    0};

const std::vector<Value> everyPayload = {"A01",
                                         "Caf\xC3\xA9",
                                         Value::data(std::array<std::uint8_t, 4>{1, 2, 3, 4}),
                                         Array::of(1.0f, 2.0f),
                                         Array::of("noon", "Caf\xC3\xA9"),
                                         Dictionary{{"TAPE", "B02"}},
                                         7};

// The same in a block and in a table.
std::vector<Dictionary> dictionariesOfEveryPayload() {
  Dictionary changed = decoded(ofEveryPayload);
  changed.set("SHOT", 1);
  changed.remove("SHOT");
  return {decoded(ofEveryPayload), changed};
}

TEST(Dictionary, LoopShowsEveryKindOfPayload) {
  for (const Dictionary& dictionary : dictionariesOfEveryPayload()) {
    std::size_t i = 0;
    for (const auto& [key, value] : dictionary) {
      EXPECT_EQ(value, everyPayload[i]) << key;
      ++i;
    }
    EXPECT_EQ(i, everyPayload.size());
  }
}

using Keeping = std::function<std::vector<Value>(const Dictionary&)>;

// Every way to keep a value from a loop beyond its dictionary.
const std::vector<std::pair<const char*, Keeping>> waysOfKeeping = {
    {"copies of the entries",
     [](const Dictionary& dictionary) {
       std::vector<Value> kept;
       for (auto entry : dictionary) kept.push_back(entry.value);
       return kept;
     }},
    {"entries moved on",
     [](const Dictionary& dictionary) {
       std::vector<Value> kept;
       for (auto entry : dictionary) kept.push_back(std::move(entry.value));
       return kept;
     }},
    {"copies of the values",
     [](const Dictionary& dictionary) {
       std::vector<Value> kept;
       for (const auto& [key, value] : dictionary) kept.push_back(value);
       return kept;
     }},
    {"values moved as far as they can be",
     [](const Dictionary& dictionary) {
       std::vector<Value> kept;
       for (auto&& entry : dictionary) kept.push_back(std::move(entry.value));
       return kept;
     }},
    {"assigned to others",
     [](const Dictionary& dictionary) {
       std::vector<Value> kept(dictionary.size(), Value("another text"));
       auto place = kept.begin();
       for (const auto& [key, value] : dictionary) *place++ = value;
       return kept;
     }},
    {"containers taken out",
     [](const Dictionary& dictionary) {
       std::vector<Value> kept;
       for (const auto& [key, value] : dictionary) {
         const Array array = value.array();
         const Dictionary inner = value.dictionary();
         kept.push_back(value.kind() == Value::Kind::array        ? Value(array)
                        : value.kind() == Value::Kind::dictionary ? Value(inner)
                                                                  : value);
       }
       return kept;
     }},
    {"what nameless iterators answer",
     [](const Dictionary& dictionary) {
       std::vector<Value> kept;
       for (auto at = dictionary.begin(); at != dictionary.end();) {
         const Dictionary::Entry& entry = *at++;
         kept.push_back(entry.value);
       }
       return kept;
     }},
    {"copies of iterators",
     [](const Dictionary& dictionary) {
       std::vector<Dictionary::Iterator> places;
       for (auto at = dictionary.begin(); at != dictionary.end(); ++at) places.push_back(at);
       std::vector<Value> kept;
       for (const auto& place : places) kept.push_back((*place).value);
       return kept;
     }},
    {"iterators assigned over one another",
     [](const Dictionary& dictionary) {
       std::vector<Value> kept;
       Dictionary::Iterator place;
       for (auto at = dictionary.begin(); at != dictionary.end(); ++at) {
         place = at;
         kept.push_back((*place).value);
       }
       return kept;
     }},
    {"a vector made of the range",
     [](const Dictionary& dictionary) {
       const std::vector<Dictionary::Entry> entries(dictionary.begin(), dictionary.end());
       std::vector<Value> kept;
       for (const auto& entry : entries) kept.push_back(entry.value);
       return kept;
     }},
};

TEST(Dictionary, WhatIsKeptFromALoopOutlivesTheDictionary) {
  for (const auto& [way, keep] : waysOfKeeping) {
    for (Dictionary& dictionary : dictionariesOfEveryPayload()) {
      const std::vector<Value> kept = keep(dictionary);
      dictionary = Dictionary();
      EXPECT_EQ(kept, everyPayload) << way;
    }
  }
}

TEST(Dictionary, LoopOverATemporaryReachesEveryLevel) {
  const Dictionary dictionary{
      {"outer", Dictionary{{"inner", Dictionary{{"REEL", "A001"}, {"LOOK", "Caf\xE9"}}}}}};
  std::vector<std::string> texts;
  for (auto& entry : dictionary["outer"].dictionary()["inner"].dictionary())
    texts.push_back(std::string(entry.value.text()));
  for (const auto& [key, outer] : dictionary) {
    for (const auto& [innerKey, inner] : outer.dictionary()) {
      for (const auto& [lastKey, value] : inner.dictionary()) texts.push_back(std::string(lastKey));
    }
  }
  EXPECT_EQ(texts, (std::vector<std::string>{"A001", "Caf\xC3\xA9", "REEL", "LOOK"}));
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

// Many entries: from some number on look-ups go through an index.

TEST(Dictionary, FindsEveryKeyAtEverySize) {
  Dictionary dictionary;
  for (int size = 1; size <= 200; ++size) {
    dictionary.set(numbered(size), size);
    ASSERT_EQ(dictionary.size(), static_cast<std::size_t>(size));
    for (int i = 1; i <= size; ++i) ASSERT_EQ(dictionary[numbered(i)], Value(i)) << "of " << size;
    ASSERT_FALSE(dictionary.contains(numbered(size + 1)));
    ASSERT_FALSE(dictionary.contains("0"));
    ASSERT_FALSE(dictionary.contains("zzzz"));
  }
}

TEST(Dictionary, KeepsOrderAndValuesThroughManyRemovals) {
  // The same in a plain list, as the measure.
  std::vector<std::pair<std::string, int>> expected;
  Dictionary dictionary;
  const auto set = [&](const std::string& key, int value) {
    dictionary.set(key, value);
    for (auto& [name, held] : expected) {
      if (name == key) {
        held = value;
        return;
      }
    }
    expected.emplace_back(key, value);
  };
  const auto remove = [&](const std::string& key) {
    const auto count =
        std::erase_if(expected, [&](const auto& entry) { return entry.first == key; });
    ASSERT_EQ(dictionary.remove(key), count == 1) << key;
  };
  const auto check = [&] {
    std::vector<std::pair<std::string, int>> entries;
    for (const auto& [key, value] : dictionary) entries.emplace_back(key, value.intValue());
    ASSERT_EQ(entries, expected);
    ASSERT_EQ(dictionary.size(), expected.size());
    for (const auto& [key, value] : expected) ASSERT_EQ(dictionary[key], Value(value)) << key;
  };

  for (int i = 0; i < 300; ++i) set(numbered(i), i);
  check();
  for (int i = 0; i < 300; i += 3) remove(numbered(i));
  check();
  for (int i = 0; i < 300; i += 2) set(numbered(i), -i);
  check();
  for (int i = 290; i >= 0; --i) {
    remove(numbered(i));
    check();
  }
  for (int i = 0; i < 50; ++i) set(numbered(i), i);
  check();
  for (int i = 0; i < 300; ++i) remove(numbered(i));
  check();
  EXPECT_TRUE(dictionary.empty());
}

// A dictionary over a block, of tags and of names, through changes of every sort.
TEST(Dictionary, ChangedDecodedOneIsAsIfItHadBeenSet) {
  Bytes stream = ofEveryPayload;
  for (const char first : {'a', 'b', 'c'}) {
    for (const Bytes& record : {Bytes{'T', 'A', 'G', 'N', 8, 0, 0, 'c', 'a', ' ', 'n', 'a', 'm',
                                      'e', ' ', static_cast<std::uint8_t>(first)},
                                Bytes{'T', 'A', 'G', 'V', 4, 0, 0, 'L', 1, 0, 0, 0}})
      stream.insert(stream.end(), record.begin(), record.end());
  }
  for (const Dictionary& start : {decoded(stream), decoded(stream)["TAG "].dictionary()}) {
    Dictionary changed = start;
    Dictionary made;
    for (const auto& [key, value] : start) made.set(key, value);
    std::uint32_t random = 1;
    for (int i = 0; i < 2000; ++i) {
      random = random * 1664525 + 1013904223;
      const std::string key = random >> 31 ? "K" + std::to_string(random % 97)
                                           : "K" + std::to_string(100 + random % 97);
      const Dictionary before = changed;
      if ((random >> 20) % 3 == 0) {
        EXPECT_EQ(changed.remove(key), made.remove(key));
        EXPECT_FALSE(changed.contains(key));
      } else {
        const Value value = i % 2 == 0 ? Value(i) : Value("text " + std::to_string(i));
        changed.set(key, value);
        made.set(key, value);
        EXPECT_EQ(changed[key], value);
      }
      ASSERT_EQ(keys(changed), keys(made));
      ASSERT_EQ(changed, made);
      if (i % 7 == 0) changed = before;
      if (i % 7 == 0) made = before;
    }
  }
}

TEST(Dictionary, ShortageOfMemoryChangesNothing) {
  for (const std::size_t count : {0u, 7u, 8u, 9u, 256u, 300u}) {
    Dictionary start = decoded(ofEveryPayload);
    for (std::size_t i = 0; i < count; ++i) start.set("name " + std::to_string(i), "a text");
    bool wasEnough = false;
    for (std::size_t granted = 0; !wasEnough; ++granted) {
      ASSERT_LT(granted, 2000u);
      const Dictionary before = start;
      Dictionary changed = start;
      bool wasFelt = false;
      try {
        const MemoryShortage shortage(granted);
        changed.set("one more key", "its text");
        changed.set("REEL", 5);
        changed.remove("LOOK");
        wasEnough = true;
      } catch (const std::bad_alloc&) {
        wasFelt = true;
      }
      EXPECT_NE(wasFelt, wasEnough);
      EXPECT_EQ(start, before);
      // A change that could not be made leaves no trace, and those before it stay.
      if (!wasEnough && !changed.contains("one more key")) {
        EXPECT_EQ(changed, before);
      }
    }
    EXPECT_FALSE(start.contains("one more key"));
  }
}

TEST(Dictionary, RemovesWithoutMemory) {
  Dictionary dictionary;
  for (int i = 0; i < 100; ++i) dictionary.set(numbered(i), i);
  {
    const MemoryShortage shortage(0);
    for (int i = 0; i < 98; ++i) EXPECT_TRUE(dictionary.remove(numbered(i)));
    EXPECT_TRUE(shortage.wasFelt());
  }
  EXPECT_EQ(dictionary, (Dictionary{{numbered(98), 98}, {numbered(99), 99}}));
  EXPECT_TRUE(dictionary.remove(numbered(98)));
  EXPECT_EQ(dictionary, (Dictionary{{numbered(99), 99}}));
}

TEST(Dictionary, ValueThatIsRemovedOrReplacedIsGivenBack) {
  const MemoryMeter meter;
  Dictionary dictionary{{"kept", 1}, {"removed", 1}, {"replaced", 1}};
  const std::size_t before = meter.held();
  dictionary.set("removed", std::string(100'000, 'x'));
  dictionary.set("replaced", std::string(100'000, 'y'));
  EXPECT_GT(meter.held(), before + 200'000);
  dictionary.remove("removed");
  dictionary.set("replaced", 2);
  EXPECT_EQ(meter.held(), before);
}

TEST(Dictionary, ChangeOfADecodedOneTakesMemoryOnce) {
  Dictionary dictionary = decoded(ofEveryPayload);
  const Value number = 7;
  const MemoryMeter meter;
  dictionary.set("TAKE", number);
  dictionary.set("SHOT", number);
  EXPECT_EQ(meter.allocations(), 1u);
}

TEST(Dictionary, IsIndexedWithoutWhatWasRemoved) {
  for (int sizeBefore = 240; sizeBefore <= 260; ++sizeBefore) {
    Dictionary dictionary;
    for (int i = 0; i < sizeBefore; ++i) dictionary.set(numbered(i), i);
    for (const int i : {0, 100, sizeBefore - 1}) dictionary.remove(numbered(i));
    for (int i = sizeBefore; i < sizeBefore + 40; ++i) dictionary.set(numbered(i), i);
    dictionary.set(numbered(100), -1);
    ASSERT_EQ(dictionary.size(), std::size_t(sizeBefore + 38));
    ASSERT_FALSE(dictionary.contains(numbered(0)));
    ASSERT_FALSE(dictionary.contains(numbered(sizeBefore - 1)));
    ASSERT_EQ(dictionary[numbered(1)], Value(1));
    ASSERT_EQ(dictionary[numbered(sizeBefore)], Value(sizeBefore));
    ASSERT_EQ(keys(dictionary).back(), numbered(100));
  }
}

TEST(Dictionary, CopyOfAnIndexedOneIsIndexedToo) {
  constexpr int many = 1000;  // more than are searched one by one
  Dictionary original;
  for (int i = 0; i < many; ++i) original.set(numbered(i), i);
  original.remove(numbered(50));
  Dictionary copy = original;
  copy.set("new", 1);
  EXPECT_EQ(copy.size(), std::size_t{many});
  EXPECT_EQ(copy[numbered(many - 1)], Value(many - 1));
  EXPECT_FALSE(copy.contains(numbered(50)));
  EXPECT_FALSE(original.contains("new"));
  EXPECT_EQ(keys(copy).back(), "new");
}

TEST(Dictionary, IsNotSlowedDownByKeysThatCollide) {
  const std::vector<std::string> names = collidingNames(50'000);
#if defined(__GLIBCXX__) && SIZE_MAX > 0xFFFFFFFF
  std::set<std::size_t> hashes;
  for (const std::string& name : names) hashes.insert(std::hash<std::string>()(name));
  ASSERT_EQ(hashes.size(), 1u) << "the names are not what this test is about";
#endif
  Dictionary dictionary;
  for (const std::string& name : names) dictionary.set(name, name);
  ASSERT_EQ(dictionary.size(), names.size());
  for (const std::string& name : names) ASSERT_EQ(dictionary[name], Value(name));
  for (std::size_t i = 0; i < names.size(); i += 2) ASSERT_TRUE(dictionary.remove(names[i]));
  EXPECT_EQ(dictionary.size(), names.size() / 2);
  EXPECT_FALSE(dictionary.contains(names[0]));
  EXPECT_TRUE(dictionary.contains(names[1]));
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
