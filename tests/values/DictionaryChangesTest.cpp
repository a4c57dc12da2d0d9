// Dictionaries through many changes: what stands in them, and what they keep of memory.

#include <cstdint>
#include <functional>
#include <new>
#include <set>
#include <string>
#include <string_view>
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
#include "tests/values/EveryPayload.h"

namespace oxmv::test {
namespace {

std::string numbered(int number) { return "key " + std::to_string(number); }

// Many entries: from some number on look-ups go through an index.

// The number is greater than 200 and smaller than 300.

TEST(DictionaryChanges, FindsEveryKeyAtEverySize) {
  Dictionary dictionary;
  for (int size = 1; size <= 300; ++size) {
    dictionary.set(numbered(size), size);
    ASSERT_EQ(dictionary.size(), static_cast<std::size_t>(size));
    for (int i = 1; i <= size; ++i) ASSERT_EQ(dictionary[numbered(i)], Value(i)) << "of " << size;
    ASSERT_FALSE(dictionary.contains(numbered(size + 1)));
    ASSERT_FALSE(dictionary.contains("0"));
    ASSERT_FALSE(dictionary.contains("zzzz"));
  }
}

// Keys that were removed are in no index, and a name that was set again is in it with its new place
// only.
TEST(DictionaryChanges, FindsEveryKeyAtEverySizeAfterRemovals) {
  Dictionary dictionary;
  for (const char* key : {"a name", "TAKE", "gone", "SHOT"}) dictionary.set(key, "old");
  for (int i = 1; i <= 30; ++i) dictionary.set(numbered(-i), "old");
  for (int i = 1; i <= 20; ++i) ASSERT_TRUE(dictionary.remove(numbered(-i)));
  for (const char* key : {"a name", "TAKE", "gone", "SHOT"}) ASSERT_TRUE(dictionary.remove(key));
  dictionary.set("a name", "new");
  dictionary.set("TAKE", 7);
  for (int size = 1; size <= 300; ++size) {
    dictionary.set(numbered(size), size);
    ASSERT_EQ(dictionary.size(), static_cast<std::size_t>(size) + 12);
    for (int i = 1; i <= size; ++i) ASSERT_EQ(dictionary[numbered(i)], Value(i)) << "of " << size;
    for (int i = 21; i <= 30; ++i) ASSERT_EQ(dictionary[numbered(-i)], Value("old"));
    for (int i = 1; i <= 20; ++i) ASSERT_FALSE(dictionary.contains(numbered(-i)));
    ASSERT_EQ(dictionary["a name"], Value("new"));
    ASSERT_EQ(dictionary["TAKE"], Value(7));
    ASSERT_FALSE(dictionary.contains("gone"));
    ASSERT_FALSE(dictionary.contains("SHOT"));
  }
  ASSERT_TRUE(dictionary.remove("a name"));
  EXPECT_FALSE(dictionary.contains("a name"));
  EXPECT_FALSE(dictionary.remove("a name"));
}

TEST(DictionaryChanges, KeepsOrderAndValuesThroughManyRemovals) {
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
TEST(DictionaryChanges, ChangedDecodedOneIsAsIfItHadBeenSet) {
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

TEST(DictionaryChanges, ShortageOfMemoryChangesNothing) {
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

TEST(DictionaryChanges, ChangeOfADecodedOneTakesMemoryOnce) {
  Dictionary dictionary = decoded(ofEveryPayload);
  const Value number = 7;
  const MemoryMeter meter;
  dictionary.set("TAKE", number);
  dictionary.set("SHOT", number);
  EXPECT_EQ(meter.allocations(), 1u);
}

// What nobody can reach any more takes no memory.

Value large() { return Value::data(Bytes(100'000, 0xAB)); }

TEST(DictionaryChanges, RemovesWithoutMemory) {
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

TEST(DictionaryChanges, RemovedValueIsGivenBackAtOnce) {
  Dictionary dictionary{{"REEL", "A001"}};
  const MemoryMeter meter;
  dictionary.set("FREE", large());
  EXPECT_GT(meter.held(), 100'000u);
  dictionary.remove("FREE");
  EXPECT_LT(meter.held(), 10'000u);
}

TEST(DictionaryChanges, ReplacedValueIsGivenBackAtOnce) {
  Dictionary dictionary{{"REEL", "A001"}};
  const MemoryMeter meter;
  dictionary.set("FREE", large());
  EXPECT_GT(meter.held(), 100'000u);
  dictionary.set("FREE", 1);
  EXPECT_LT(meter.held(), 10'000u);
}

// A stream of numbers, a text and 100 kB.
const Bytes ofMuchData = StreamBuilder()
                             .record("TAKE", 'B', 7)
                             .record("REEL", 'c', "A01")
                             .record("SATU", 'f', 0.5f)
                             .record("FREE", 'c', Bytes(100'000, 0xAB))
                             .record("LCRC", 'H', -1)
                             .bytes();

TEST(DictionaryChanges, BlockIsKeptWhileAnythingStandsThere) {
  const MemoryMeter meter;
  Dictionary dictionary = decoded(ofMuchData);
  dictionary.remove("FREE");
  EXPECT_GT(meter.held(), 100'000u);
  EXPECT_EQ(dictionary, (Dictionary{{"TAKE", 7}, {"REEL", "A01"}, {"SATU", 0.5f}, {"LCRC", -1}}));
}

TEST(DictionaryChanges, BlockIsGivenBackWithTheLastValueThere) {
  const std::vector<std::function<void(Dictionary&)>> ways = {
      [](Dictionary& dictionary) {
        dictionary.remove("FREE");
        dictionary.remove("REEL");
      },
      [](Dictionary& dictionary) {
        dictionary.set("FREE", 1);
        dictionary.set("REEL", 2);
      },
      [](Dictionary& dictionary) {
        dictionary.remove("REEL");
        dictionary.set("FREE", 1);
      },
      [](Dictionary& dictionary) {
        for (int i = 0; i < 40; ++i) dictionary.set(numbered(i), i);
        dictionary.set("REEL", "another");
        dictionary.remove("FREE");
      },
      [](Dictionary& dictionary) {
        for (const std::string& key : keys(dictionary)) dictionary.remove(key);
      },
  };
  for (const auto& change : ways) {
    const MemoryMeter meter;
    Dictionary dictionary = decoded(ofMuchData);
    Dictionary expected;
    for (const auto& [key, value] : dictionary) expected.set(key, 0);
    for (const char* key : {"TAKE", "SATU", "LCRC"}) expected.set(key, dictionary[key]);
    change(dictionary);
    change(expected);
    EXPECT_LT(meter.held(), 20'000u);
    EXPECT_EQ(dictionary, expected);
    EXPECT_EQ(keys(dictionary), keys(expected));
    dictionary.set("SHOT", "one more");
    dictionary.remove("TAKE");
    expected.set("SHOT", "one more");
    expected.remove("TAKE");
    EXPECT_EQ(dictionary, expected);
    EXPECT_EQ(keys(dictionary), keys(expected));
  }
}

TEST(DictionaryChanges, BlockOfAnotherDictionaryStays) {
  Dictionary changed = decoded(ofMuchData);
  const Dictionary copy = changed;
  for (const std::string& key : keys(copy)) changed.set(key, 1);
  EXPECT_EQ(copy["FREE"], large());
  EXPECT_EQ(copy["REEL"], Value("A01"));
}

TEST(DictionaryChanges, BlockOfNumbersIsLeftWithTheFirstChange) {
  StreamBuilder stream;
  for (int i = 0; i < 10'000; ++i) stream.record("TAKE", 'B', i).record("LCRC", 'H', i);
  const MemoryMeter meter;
  Dictionary dictionary = decoded(stream.bytes());
  dictionary.set("SHOT", 1);
  EXPECT_LT(meter.held(), 10'000u);
  EXPECT_EQ(dictionary, (Dictionary{{"TAKE", 9999}, {"LCRC", 9999}, {"SHOT", 1}}));
}

TEST(DictionaryChanges, IsIndexedWithoutWhatWasRemoved) {
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

TEST(DictionaryChanges, CopyOfAnIndexedOneIsIndexedToo) {
  Dictionary original;
  for (int i = 0; i < 300; ++i) original.set(numbered(i), i);
  original.remove(numbered(50));
  Dictionary copy = original;
  copy.set("new", 1);
  EXPECT_EQ(copy.size(), 300u);
  for (int i = 0; i < 300; ++i) EXPECT_EQ(copy[numbered(i)], i == 50 ? Value() : Value(i));
  EXPECT_FALSE(copy.contains(numbered(50)));
  EXPECT_FALSE(copy.contains(numbered(300)));
  EXPECT_FALSE(original.contains("new"));
  EXPECT_EQ(keys(copy).back(), "new");
}

TEST(DictionaryChanges, IsNotSlowedDownByKeysThatCollide) {
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

}  // namespace
}  // namespace oxmv::test
