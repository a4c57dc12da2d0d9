// What a loop lends, and how it is kept.

#include <array>
#include <cstdint>
#include <functional>
#include <iterator>
#include <string>
#include <utility>
#include <vector>

#include <gtest/gtest.h>

#include "oxmv/values/Array.h"
#include "oxmv/values/Dictionary.h"
#include "tests/support/Decoding.h"
#include "tests/support/Printing.h"
#include "tests/values/EveryPayload.h"

namespace oxmv::test {
namespace {

static_assert(std::input_iterator<Dictionary::Iterator>);

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

}  // namespace
}  // namespace oxmv::test
