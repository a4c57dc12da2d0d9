// The same entries give the same bytes however they are held: in the block of the stream that they
// were decoded from, in a table over that block, or each for itself.

#include <algorithm>
#include <cstdint>
#include <optional>
#include <random>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include <gtest/gtest.h>

#include "oxmv/metadata/TagStreamDecoder.h"
#include "oxmv/metadata/TagTable.h"
#include "oxmv/values/Array.h"
#include "tests/support/Decoding.h"
#include "tests/support/Encoding.h"
#include "tests/support/Memory.h"
#include "tests/support/Printing.h"
#include "tests/support/StreamBuilder.h"

namespace oxmv::test {
namespace {

// Streams of records whose payloads have every length up to 40 and some around the longest that are
// kept, most of them text with a NUL somewhere, and a few letters that are not ASCII.
class StreamMaker {
 public:
  explicit StreamMaker(std::uint32_t seed) : random_(seed) {}

  Bytes stream(std::size_t records, int depth) {
    StreamBuilder builder;
    for (std::size_t i = 0; i < records; ++i) {
      const TagRow& row = tagRows()[below(tagRows().size())];
      const auto characters = charactersOf(row.tag);
      builder.record({characters.data(), characters.size()}, typeOf(row), payload(row, depth));
      if (oneIn(20)) builder.record("ZZZZ", 'c', text());
      if (oneIn(10)) group(builder);
    }
    return builder.bytes();
  }

 private:
  std::size_t below(std::size_t end) { return random_() % end; }
  bool oneIn(std::size_t count) { return below(count) == 0; }

  static char typeOf(const TagRow& row) {
    return row.read == Read::regValue ? 'L' : static_cast<char>(recordTypeOf(row.write));
  }

  Bytes payload(const TagRow& row, int depth) {
    switch (row.read) {
      case Read::floats: return data(oneIn(10) ? below(60) : row.count * 4u);
      case Read::nested:
      case Read::nestedList: return depth > 0 ? stream(below(8), depth - 1) : Bytes();
      case Read::controlPoint: {
        Bytes point = data(8);
        const Bytes nested = depth > 0 ? stream(below(8), depth - 1) : Bytes();
        point.insert(point.end(), nested.begin(), nested.end());
        return point;
      }
      default: return oneIn(3) ? data(below(12)) : text();
    }
  }

  void group(StreamBuilder& builder) {
    const bool isReg = oneIn(2);
    for (std::size_t i = below(30); i > 0; --i) {
      builder.record(isReg ? "REGN" : "TAGN", 'c', text());
      if (oneIn(3)) {
        builder.record(isReg ? "REGV" : "TAGV", 'L', data(4));
      } else {
        builder.record(isReg ? "REGV" : "TAGV", 'c', text());
      }
    }
  }

  Bytes data(std::size_t size) {
    Bytes made(size);
    for (std::uint8_t& byte : made) byte = static_cast<std::uint8_t>(random_());
    return made;
  }

  Bytes text() {
    Bytes made(oneIn(10) ? 250 + below(15) : below(41));
    for (std::uint8_t& byte : made) byte = static_cast<std::uint8_t>('a' + below(26));
    if (made.empty()) return made;
    if (oneIn(2)) made[below(made.size())] = 0;
    if (oneIn(6)) made[below(made.size())] = 0xE9;
    return made;
  }

  std::mt19937 random_;
};

// The same value with nothing of it in a block.
Value apart(const Value& value) {
  switch (value.kind()) {
    case Value::Kind::text: return Value(std::string(value.text()));
    case Value::Kind::data: return Value::data(value.data());
    case Value::Kind::array: {
      std::vector<Value> elements;
      for (const Value& element : value.array()) elements.push_back(apart(element));
      return Array(std::move(elements));
    }
    case Value::Kind::dictionary: {
      Dictionary copy;
      for (const auto& [key, inner] : value.dictionary()) copy.set(key, apart(inner));
      return copy;
    }
    case Value::Kind::nothing:
    case Value::Kind::integer:
    case Value::Kind::float32:
    case Value::Kind::float64: break;
  }
  return value;
}

// In a table over the block.
Dictionary changedAndBack(const Dictionary& tags) {
  Dictionary changed = tags;
  changed.set("a key of its own", 1);
  changed.remove("a key of its own");
  return changed;
}

// In a table, every second value its own, beside places that are vacant.
Dictionary halfReplaced(const Dictionary& tags) {
  Dictionary changed{
      {"PRCS", 1}, {"a key of its own", 2}, {"KWRd", Array()}, {"COL1", Dictionary()},
      {"TAKE", 3}, {"SATU", 0.5f},          {"DTIN", 4}};
  for (const Names before = keys(changed); const std::string& key : before) changed.remove(key);
  for (const auto& [key, value] : tags) changed.set(key, value);
  bool isSecond = false;
  for (const auto& [key, value] : tags) {
    if (isSecond) changed.set(key, apart(value));
    isSecond = !isSecond;
  }
  return changed;
}

// In a table that has left the block, for nothing stands there but numbers.
Dictionary allButNumbersReplaced(const Dictionary& tags) {
  Dictionary changed = tags;
  for (const auto& [key, value] : tags) {
    if (!value.isNumber()) changed.set(key, apart(value));
  }
  return changed;
}

void expectSameBytes(const Dictionary& tags) {
  for (const Layout layout : {Layout::exact, Layout::readable}) {
    const Bytes stream = encoded(tags, layout);
    ASSERT_EQ(encoded(apart(tags).dictionary(), layout), stream);
    ASSERT_EQ(encoded(changedAndBack(tags), layout), stream);
    ASSERT_EQ(encoded(halfReplaced(tags), layout), stream);
    ASSERT_EQ(encoded(allButNumbersReplaced(tags), layout), stream);
  }
}

TEST(TagStreamEncoderPaths, GiveTheSameBytes) {
  for (std::uint32_t seed = 0; seed < 400; ++seed) {
    SCOPED_TRACE(seed);
    StreamMaker maker(seed);
    expectSameBytes(decoded(maker.stream(seed % 50, 3)));
  }
}

TEST(TagStreamEncoderPaths, GiveTheSameBytesOfEveryPrefix) {
  StreamMaker maker(7);
  const Bytes stream = maker.stream(20, 1);
  for (std::size_t size = 0; size <= stream.size(); ++size) {
    SCOPED_TRACE(size);
    expectSameBytes(decoded({stream.begin(), stream.begin() + static_cast<std::ptrdiff_t>(size)}));
  }
}

// A text of every length at every distance from the end of the block.
TEST(TagStreamEncoderPaths, TextsNearTheEnd) {
  for (std::size_t length = 0; length < 70; ++length) {
    const std::string text(length, 'x');
    for (std::size_t behind = 0; behind < 48; behind += 4) {
      StreamBuilder builder;
      builder.record("REEL", 'c', text).record("KWRd", 'c', text).record("TAGN", 'c', text);
      builder.record("TAGV", 'c', text).record("FREE", 'c', std::string(behind, 'y'));
      expectSameBytes(decoded(builder.bytes()));
    }
  }
}

TEST(TagStreamEncoderPaths, GroupEntriesUnderNamesOfTagsAreNoPlainValues) {
  StreamBuilder builder;
  for (const char* name :
       {"REEL", "TAKE", "SATU", "WBAL", "KWRd", "COL1", "PRCS", "TIMC", "FREE"}) {
    builder.record("TAGN", 'c', name).record("TAGV", 'c', "a text with a \0 in it");
    builder.record("REGN", 'c', name).record("REGV", 'L', 7);
  }
  const Dictionary tags = decoded(builder.bytes());
  expectSameBytes(tags["TAG "].dictionary());
  expectSameBytes(tags["REG "].dictionary());
}

TEST(TagStreamEncoderPaths, RemovedEntriesOfGroupsAreNotWritten) {
  for (const char* key : {"TAG ", "REG "}) {
    Dictionary group{{"first", 1}, {"a text", "x"}, {"last", 3}};
    const Dictionary left{{"a text", "x"}};
    group.remove("first");
    group.remove("last");
    EXPECT_EQ(encoded(Dictionary{{key, group}}), encoded(Dictionary{{key, left}}));
    group.remove("a text");
    EXPECT_EQ(encoded(Dictionary{{key, group}}), Bytes());
  }
}

// What was removed leaves its place, and nothing goes out for it.
TEST(TagStreamEncoderPaths, NothingIsWrittenOfWhatWasRemoved) {
  const Dictionary kept = {{"TAKE", 1}};
  for (const char* key : {"REEL", "PRCS", "TIMC", "COL1", "DTIN", "CTLp", "KWRd", "CTLPData"}) {
    Dictionary changed = kept;
    changed.set(key, Array::of(1, 2));
    changed.remove(key);
    EXPECT_EQ(encoded(changed), encoded(kept)) << key;
  }
  for (const char* group : {"TAG ", "REG "}) {
    Dictionary entries = {{"ISO", 400}, {"Lens", "35mm"}, {"REEL", 1}};
    entries.remove("Lens");
    entries.remove("REEL");
    EXPECT_EQ(encoded({{group, entries}}), encoded({{group, Dictionary{{"ISO", 400}}}}));
  }
  Dictionary point = {{"a long name", 1}, {"CTLPData", Array::of(1, 2)}, {"another", 2}};
  point.remove("a long name");
  EXPECT_EQ(encoded({{"CTLp", Array::of(point)}}),
            encoded({{"CTLp", Array::of(Dictionary{{"CTLPData", Array::of(1, 2)}})}}));
  point.remove("CTLPData");
  EXPECT_EQ(encoded({{"CTLp", Array::of(point)}}), encoded({{"CTLp", Array::of(Dictionary())}}));
}

// Memory.

std::size_t allocationsOf(const Dictionary& tags) {
  const MemoryMeter meter;
  const auto stream = encodeStream(tags);
  EXPECT_TRUE(stream.has_value());
  return meter.allocations();
}

TEST(TagStreamEncoderPaths, DecodedStreamTakesMemoryOnce) {
  for (const std::size_t keywords : {1u, 100u, 300u, 3000u}) {
    StreamBuilder builder;
    for (std::size_t i = 0; i < keywords; ++i) builder.record("KWRd", 'c', "ABCDEFGH");
    builder.record("WBAL", 'f', Bytes(16, 0x3F)).record("COL1", 0, builder.bytes());
    Dictionary tags = decoded(builder.bytes());
    EXPECT_EQ(allocationsOf(tags), 1u) << keywords;
    tags.set("WBAL", Array::of(1.0f, 2.0f, 3.0f, 4.0f));
    EXPECT_EQ(allocationsOf(tags), 1u) << keywords;
  }
}

TEST(TagStreamEncoderPaths, StreamOfAPartTakesNoMoreMemoryThanThatPart) {
  StreamBuilder builder;
  builder.record("REEL", 'c', bytesOf({"A01\0", 4}));
  const Bytes nested = builder.bytes();
  builder.record("COL1", 0, nested).record("FREE", 'c', std::string(100'000, 'x'));
  const Dictionary part = decoded(builder.bytes())["COL1"].dictionary();
  const MemoryMeter meter;
  const auto stream = encodeStream(part);
  EXPECT_LT(meter.peak(), 1000u);
  EXPECT_EQ(stream, nested);
}

// A dictionary of which nearly all was removed since it was decoded.
Dictionary littleIsLeft(std::size_t removed) {
  StreamBuilder builder;
  for (int i = 0; i < 1000; ++i) builder.record("KWRd", 'c', "ABCDEFGH");
  builder.record("FREE", 'c', std::string(removed, 'x'));
  Dictionary tags = decoded(builder.bytes());
  tags.remove("FREE");
  return tags;
}

TEST(TagStreamEncoderPaths, StreamOfWhatIsLeftKeepsNoMoreMemoryThanThat) {
  for (const std::size_t removed : {0u, 15'000u, 17'000u, 1'000'000u}) {
    const auto stream = encodeStream(littleIsLeft(removed));
    ASSERT_TRUE(stream);
    EXPECT_EQ(stream->size(), 16'000u);
    EXPECT_LE(stream->capacity(), 32'000u) << removed;
  }
}

TEST(TagStreamEncoderPaths, MemoryForWhatIsLeftIsEnough) {
  const Dictionary tags = littleIsLeft(1'000'000);
  const Bytes expected = encoded(tags);
  std::optional<Bytes> stream;
  {
    const LargeMemoryShortage shortage(100'000);
    stream = encodeStream(tags);
  }
  EXPECT_EQ(stream, expected);
}

}  // namespace
}  // namespace oxmv::test
