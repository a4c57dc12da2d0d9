// What decoding and encoding cost.
//
//   decode       -- a clip of 60 tags with a nested COL1 and a TAG group, decoded and dropped
//   decodeRead   -- the same, and every key and value read
//   encode       -- the decoded dictionary encoded
//   edit         -- decoded, WBAL replaced, encoded
//   lookUp       -- eight look-ups by tag
//   copyStream   -- the floor: memory for the stream's bytes, and a copy of them
//
// Each runs over many different clips in turn: with one and the same, the processor learns it by
// heart.

#include <bit>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <memory>
#include <random>
#include <string>
#include <vector>

#include <benchmark/benchmark.h>

#include "oxmv/metadata/MetadataDictionary.h"
#include "oxmv/metadata/TagStreamDecoder.h"
#include "oxmv/metadata/TagTable.h"
#include "oxmv/values/Array.h"

namespace {

using namespace oxmv;
using Stream = std::vector<std::uint8_t>;

constexpr std::size_t clipCount = 2048;

class ClipMaker {
 public:
  // `count` different tags in random order, each with a random value of its kind.
  Dictionary tags(std::size_t count) {
    std::vector<TagRow> rows;
    for (const TagRow& row : tagRows()) {
      if (isPlain(row)) rows.push_back(row);
    }
    std::shuffle(rows.begin(), rows.end(), random_);
    Dictionary made;
    for (std::size_t i = 0; i < count; ++i) {
      const auto characters = charactersOf(rows[i].tag);
      made.set({characters.data(), characters.size()}, value(rows[i]));
    }
    return made;
  }

  Dictionary clip() {
    Dictionary made = tags(60);
    made.set("COL1", tags(20));
    Dictionary group;
    for (int i = 0; i < 15; ++i) group.set("entry " + std::to_string(i), text(12));
    made.set("TAG ", group);
    made.set("KWRd", Array::of(text(9), text(5), text(7), text(11), text(4)));
    return made;
  }

 private:
  static bool isPlain(const TagRow& row) {
    if (row.when == When::deferred) return false;
    return row.read == Read::text || row.read == Read::int32 || row.read == Read::uint8 ||
           row.read == Read::float32 || row.read == Read::floats;
  }

  Value value(const TagRow& row) {
    switch (row.read) {
      case Read::text: return text(1 + random_() % 24);
      case Read::uint8: return static_cast<std::int32_t>(random_() & 0xFF);
      case Read::float32: return number();
      case Read::floats: {
        std::vector<Value> floats;
        for (int i = 0; i < row.count; ++i) floats.emplace_back(number());
        return Array(std::move(floats));
      }
      default: return static_cast<std::int32_t>(random_());
    }
  }

  Value text(std::size_t length) {
    std::string made;
    for (std::size_t i = 0; i < length; ++i) made += static_cast<char>('a' + random_() % 26);
    return Value(made);
  }

  float number() { return static_cast<float>(random_() % 4096) / 512.0f; }

  std::mt19937 random_{20261121};
};

const std::vector<Stream>& streams() {
  static const std::vector<Stream> made = [] {
    ClipMaker maker;
    std::vector<Stream> all;
    for (std::size_t i = 0; i < clipCount; ++i) all.push_back(encodeStream(maker.clip()).value());
    return all;
  }();
  return made;
}

Dictionary decode(const Stream& stream) {
  return decodeStream(stream, static_cast<std::int32_t>(stream.size()));
}

const std::vector<Dictionary>& dictionaries() {
  static const std::vector<Dictionary> made = [] {
    std::vector<Dictionary> all;
    for (const Stream& stream : streams()) all.push_back(decode(stream));
    return all;
  }();
  return made;
}

std::size_t readAll(const Value& value);

std::size_t readAll(const Dictionary& tags) {
  std::size_t sum = 0;
  for (const auto& [key, value] : tags) sum += key.size() + readAll(value);
  return sum;
}

std::size_t readAll(const Value& value) {
  switch (value.kind()) {
    case Value::Kind::dictionary: return readAll(value.dictionary());
    case Value::Kind::array: {
      std::size_t sum = 0;
      const Array array = value.array();
      for (const Value& element : array) sum += readAll(element);
      return sum;
    }
    case Value::Kind::text: return value.text().size();
    case Value::Kind::data: return value.data().size();
    case Value::Kind::float32: return std::bit_cast<std::uint32_t>(value.floatValue());
    default: return static_cast<std::size_t>(value.intValue());
  }
}

// Runs `body` over every item in turn, round and round.
template <class Items, class Body>
void overAll(benchmark::State& state, const Items& items, Body body) {
  std::size_t i = 0;
  for (auto _ : state) {
    body(items[i]);
    i = (i + 1) % items.size();
  }
}

void copyStream(benchmark::State& state) {
  overAll(state, streams(), [](const Stream& stream) {
    const auto copy = std::make_unique_for_overwrite<std::uint8_t[]>(stream.size());
    std::memcpy(copy.get(), stream.data(), stream.size());
    benchmark::DoNotOptimize(copy.get()[stream.size() - 1]);
  });
}
BENCHMARK(copyStream);

void decode(benchmark::State& state) {
  overAll(state, streams(), [](const Stream& stream) { benchmark::DoNotOptimize(decode(stream)); });
}
BENCHMARK(decode);

void decodeRead(benchmark::State& state) {
  overAll(state, streams(),
          [](const Stream& stream) { benchmark::DoNotOptimize(readAll(decode(stream))); });
}
BENCHMARK(decodeRead);

void encode(benchmark::State& state) {
  overAll(state, dictionaries(),
          [](const Dictionary& tags) { benchmark::DoNotOptimize(encodeStream(tags)); });
}
BENCHMARK(encode);

void edit(benchmark::State& state) {
  const Value balance = Array::of(1.0f, 1.2f, 1.05f, 1.5f);
  overAll(state, streams(), [&](const Stream& stream) {
    Dictionary tags = decode(stream);
    tags.set("WBAL", balance);
    benchmark::DoNotOptimize(encodeStream(tags));
  });
}
BENCHMARK(edit);

void lookUp(benchmark::State& state) {
  overAll(state, dictionaries(), [](const Dictionary& tags) {
    for (const char* tag : {"REEL", "TIMC", "WBAL", "SATU", "COL1", "TAG ", "KWRd", "TAKE"}) {
      benchmark::DoNotOptimize(tags[tag]);
    }
  });
}
BENCHMARK(lookUp);

}  // namespace
