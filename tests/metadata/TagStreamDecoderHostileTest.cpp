// Streams that somebody made to cost more than they should. None of these tests looks at a clock:
// work is counted in records that the decoder comes to, memory in bytes taken from the heap.

#include <bit>
#include <cmath>
#include <memory>
#include <new>
#include <string>
#include <string_view>
#include <vector>

#include <gtest/gtest.h>

#include "oxmv/metadata/TagStreamDecoder.h"
#include "oxmv/metadata/TagTable.h"
#include "oxmv/values/Array.h"
#include "tests/support/CollidingNames.h"
#include "tests/support/Decoding.h"
#include "tests/support/Memory.h"
#include "tests/support/Printing.h"
#include "tests/support/StreamBuilder.h"

namespace oxmv::test {
namespace {

using namespace std::string_view_literals;

constexpr std::size_t mebi = 1024 * 1024;

// Counts, and remembers nothing.
class Counter final : public StreamObserver {
 public:
  std::size_t visits = 0;
  int deepest = 0;

  void onRecord(const Record& record) override {
    ++visits;
    deepest = std::max(deepest, record.level);
  }
};

// What decoding may take from the heap, in bytes for each byte of the stream. Meanwhile: the
// dearest record is an empty stream within a stream, 16 bytes that need two notes of 12 bytes and
// some six places of 8; these are gathered in vectors that double, and whose former memory stays
// until the end. In the end: the stream's bytes, and those places.
constexpr std::size_t meanwhile = 40;
constexpr std::size_t inTheEnd = 6;
constexpr std::size_t forAnyStream = 16 * 1024;

// Decodes, and expects that neither work nor memory grow faster than the stream.
Dictionary decodedWithinBounds(const Bytes& stream) {
  Counter counter;
  const auto length = static_cast<std::int32_t>(stream.size());
  const Dictionary heard = decodeStream(stream, length, nullptr, &counter);
  EXPECT_LE(counter.visits, stream.size());
  EXPECT_LT(counter.deepest, 64);

  const MemoryMeter meter;
  Dictionary tags = decodeStream(stream, length);
  EXPECT_LE(meter.peak(), meanwhile * stream.size() + forAnyStream);
  EXPECT_LE(meter.held(), inTheEnd * stream.size() + forAnyStream);
  EXPECT_EQ(tags, heard);
  return tags;
}

std::size_t levelsOf(Dictionary tags) {
  std::size_t levels = 1;
  for (; tags.contains("COL1"); ++levels) tags = tags["COL1"].dictionary();
  return levels;
}

// Sizes whose record length wraps.

TEST(TagStreamDecoderHostile, WrappedLengthsOfEveryTagInAShortStream) {
  for (std::uint32_t size = 0xFFFFF5; size <= 0xFFFFFF; ++size) {
    for (const TagRow& row : tagRows()) {
      const std::array<char, 4> tag = charactersOf(row.tag);
      StreamBuilder stream;
      stream.record("TAGN", 'c', "n").record("REGN", 'c', "n").marker(0xFFFF);
      stream.header({tag.data(), 4}, size, 'c').raw(Bytes(48, 0xFF));
      decoded(stream.bytes());

      StreamBuilder first;
      first.header({tag.data(), 4}, size, 'c').raw(stream.bytes());
      Counter counter;
      decodeStream(first.bytes(), 0x7FFFFFFF, nullptr, &counter);
      EXPECT_LE(counter.visits, first.bytes().size()) << std::string_view(tag.data(), 4) << size;
      decoded(first.bytes(), 0x7FFFFFFF);
    }
  }
}

TEST(TagStreamDecoderHostile, WrappedLengthsInALongStream) {
  for (std::uint32_t size = 0xFFFFF5; size <= 0xFFFFFF; ++size) {
    for (const std::string_view tag : {"KWRd"sv, "COL1"sv, "ZZZZ"sv}) {
      const Bytes unit = StreamBuilder().header(tag, size, 'c').bytes();
      const Bytes stream = repeated(unit, 16 * mebi + 64 * 1024);
      Counter counter;
      const Dictionary tags =
          decodeStream(stream, static_cast<std::int32_t>(stream.size()), nullptr, &counter);
      EXPECT_LE(counter.visits, stream.size()) << tag << ' ' << size;
      EXPECT_EQ(tags.contains(tag), tag != "ZZZZ") << tag << ' ' << size;
    }
  }
}

TEST(TagStreamDecoderHostile, SixteenMebibytesOfTheSameEightBytes) {
  // "KWRd", size 0xFFFFFD, 'c': a length of 8, so that every unit claims nearly all that follows.
  const Bytes stream =
      repeated({0x4B, 0x57, 0x52, 0x64, 0xFD, 0xFF, 0xFF, 0x63}, 16 * mebi + 64 * 1024);
  const Dictionary tags = decodedWithinBounds(stream);
  // The first takes 0xFFFFFD bytes, which leaves too few for a second.
  EXPECT_EQ(keys(tags), (Names{"KWRd"}));
  ASSERT_EQ(tags["KWRd"].array().size(), 1u);
  EXPECT_EQ(tags["KWRd"].array()[0].length(), 0xFFFFFDu);
}

TEST(TagStreamDecoderHostile, SixteenMebibytesOfOverlappingNestedStreams) {
  const Bytes unit = StreamBuilder().header("DSPm", 0xFFFFFD, 0).bytes();
  const Dictionary tags = decodedWithinBounds(repeated(unit, 16 * mebi + 64 * 1024));
  EXPECT_EQ(tags["DSPm"].array().size(), 1u);
}

TEST(TagStreamDecoderHostile, NestedStreamsThatClaimTheSameBytes) {
  // 30 units: a stream of 8 bytes, whose one record claims all units that follow.
  StreamBuilder stream;
  for (std::uint32_t left = 30; left-- > 0;)
    stream.header("COL1", 8, 0).header("COL1", 16 * left, 0);
  ASSERT_EQ(stream.bytes().size(), 480u);
  EXPECT_EQ(decodedWithinBounds(stream.bytes()), (Dictionary{{"COL1", Dictionary()}}));
  EXPECT_EQ(witnessOf(stream.bytes()).visits.size(), 60u);
}

// Lengths.

TEST(TagStreamDecoderHostile, FirstRecordLongerThanTheStream) {
  for (const TagRow& row : tagRows()) {
    const std::array<char, 4> tag = charactersOf(row.tag);
    for (std::size_t there = 0; there <= 32; ++there) {
      StreamBuilder stream;
      stream.header({tag.data(), 4}, 0x7FFFFF, 'c').raw(Bytes(there, 'x'));
      EXPECT_LE(decoded(stream.bytes()).size(), 1u);
      EXPECT_LE(decoded(stream.bytes(), 1).size(), 1u);
      EXPECT_LE(decoded(stream.bytes(), 0x7FFFFFFF).size(), 1u);
    }
  }
}

TEST(TagStreamDecoderHostile, NestedSizesPastTheEnd) {
  for (const char* tag : {"COL1", "COL2", "DSPm", "CTLp"}) {
    for (const std::uint32_t size : {29u, 64u, 0x10000u, 0xFFFFF4u}) {
      StreamBuilder inner, stream;
      inner.record("TIMB", 'B', 1).header(tag, size, 0).record("TAKE", 'B', 1);
      stream.record("COL2", 0, inner.bytes()).record("SHOT", 'B', 1);
      EXPECT_EQ(decoded(stream.bytes()),
                (Dictionary{{"COL2", Dictionary{{"TIMB", 1}}}, {"SHOT", 1}}))
          << tag << ' ' << size;
    }
  }
}

TEST(TagStreamDecoderHostile, MarkersWhoseCountsOverflow32Bits) {
  // 20000 times 4 times 0xFFFF is more than 2^32: a limit that wrapped would end the walk.
  StreamBuilder stream;
  for (int i = 0; i < 20'000; ++i) stream.header("KWRd", 0, 'c').marker(0xFFFF);
  const Dictionary tags = decodedWithinBounds(stream.bytes());
  EXPECT_EQ(tags["KWRd"].array().size(), 20'000u);
  EXPECT_EQ(decoded(stream.bytes(), 9)["KWRd"].array().size(), 20'000u);
}

TEST(TagStreamDecoderHostile, MarkerRaisesTheLimitPastTheGreatestLength) {
  StreamBuilder stream;
  stream.record("PRCS", 'L', 1).marker(0xFFFF).record("TAKE", 'B', 2);
  EXPECT_EQ(decoded(stream.bytes(), 0x7FFFFFFF), (Dictionary{{"PRCS", 1}, {"TAKE", 2}}));
}

TEST(TagStreamDecoderHostile, NothingButMarkers) {
  const Bytes stream = repeated({0xBF, 0xFE, 0xFF, 0xFF}, mebi);
  EXPECT_EQ(decodedWithinBounds(stream), Dictionary());
}

// Depth.

TEST(TagStreamDecoderHostile, NestedTwoMillionDeep) {
  // Every level is 8 bytes of header and the rest; the outermost size is the last that does not
  // wrap and is a multiple of 8.
  constexpr std::uint32_t outermost = 0xFFFFF0;
  StreamBuilder stream;
  for (std::uint32_t size = outermost;; size -= 8) {
    stream.header("COL1", size, 0);
    if (size == 0) break;
  }
  ASSERT_EQ(stream.bytes().size(), outermost + 8u);
  const Dictionary tags = decodedWithinBounds(stream.bytes());
  EXPECT_EQ(levelsOf(tags), 64u);
}

TEST(TagStreamDecoderHostile, NestsSixtyFourLevelsAndNoMore) {
  for (const char* tag : {"COL1", "COL2", "DSPm", "CTLp"}) {
    const bool isControlPoint = tag == "CTLp"sv;
    // From the inside out: level 64 is one too deep.
    Bytes level = StreamBuilder().record("PRCS", 'L', 64).bytes();
    for (int number = 63; number >= 0; --number) {
      StreamBuilder outer;
      outer.record(tag, 0, StreamBuilder().raw(Bytes(isControlPoint ? 8 : 0)).raw(level).bytes());
      level = outer.record("PRCS", 'L', number).bytes();
    }
    Value tags = decoded(level);
    for (int number = 0; number < 64; ++number) {
      ASSERT_EQ(tags.dictionary()["PRCS"], Value(number)) << tag;
      const Value next = tags.dictionary()[tag];
      ASSERT_EQ(next.isNothing(), number == 63) << tag << ' ' << number;
      tags = next.kind() == Value::Kind::array ? next.array()[0] : next;
    }
  }
}

TEST(TagStreamDecoderHostile, ManyStreamsOfGreatDepth) {
  Bytes deep;
  for (int i = 0; i < 200; ++i) deep = StreamBuilder().record("COL2", 0, deep).bytes();
  StreamBuilder stream;
  while (stream.bytes().size() < mebi) stream.record("DSPm", 0, deep);
  const std::size_t count = stream.bytes().size() / (deep.size() + 8);
  EXPECT_EQ(decodedWithinBounds(stream.bytes())["DSPm"].array().size(), count);
}

// Numbers of things.

TEST(TagStreamDecoderHostile, MillionEmptyElements) {
  for (const char* tag : {"KWRd", "DSPm"}) {
    const Bytes stream = repeated(StreamBuilder().header(tag, 0, 0).bytes(), 8'000'000);
    EXPECT_EQ(decodedWithinBounds(stream)[tag].array().size(), 1'000'000u);
  }
}

TEST(TagStreamDecoderHostile, MillionElementsInTurns) {
  StreamBuilder turn;
  for (const char* tag : {"CMId", "DRPt", "DRTr", "KWRd", "LOCn", "PRDl", "PROd", "SHTy", "DSPm"})
    turn.header(tag, 0, 0);
  const Dictionary tags = decodedWithinBounds(repeated(turn.bytes(), 9 * 8 * 100'000));
  ASSERT_EQ(tags.size(), 9u);
  for (const auto& [key, value] : tags) EXPECT_EQ(value.array().size(), 100'000u) << key;
}

TEST(TagStreamDecoderHostile, MillionControlPoints) {
  const Bytes unit = StreamBuilder().header("CTLp", 8, 0).raw({1, 0, 0, 0, 2, 0, 0, 0}).bytes();
  const Dictionary tags = decodedWithinBounds(repeated(unit, 16'000'000));
  ASSERT_EQ(tags["CTLp"].array().size(), 1'000'000u);
  EXPECT_EQ(tags["CTLp"].array()[999'999], Value(Dictionary{{"CTLPData", Array::of(1, 2)}}));
}

TEST(TagStreamDecoderHostile, MillionEmptyStreamsWithinStreams) {
  const Bytes unit = StreamBuilder().header("DSPm", 8, 0).header("DSPm", 0, 0).bytes();
  const Dictionary tags = decodedWithinBounds(repeated(unit, 16'000'000));
  ASSERT_EQ(tags["DSPm"].array().size(), 1'000'000u);
  EXPECT_EQ(tags["DSPm"].array()[999'999], Value(Dictionary{{"DSPm", Array::of(Dictionary())}}));
}

TEST(TagStreamDecoderHostile, ManyGroupEntries) {
  StreamBuilder same, different, converted;
  for (int i = 0; i < 50'000; ++i) {
    same.header("TAGN", 0, 'c').header("TAGV", 0, 'c');
    different.record("REGN", 'c', std::to_string(100'000 + i * 7919 % 50'000));
    different.header("REGV", 0, 'c');
    converted.record("TAGN", 'c', std::to_string(i) + "\xFF").header("TAGV", 0, 'c');
  }
  EXPECT_EQ(decodedWithinBounds(same.bytes())["TAG "].dictionary().size(), 1u);
  EXPECT_EQ(decodedWithinBounds(different.bytes())["REG "].dictionary().size(), 50'000u);
  EXPECT_EQ(decodedWithinBounds(converted.bytes())["TAG "].dictionary().size(), 50'000u);
}

TEST(TagStreamDecoderHostile, ManyCollidingGroupNames) {
  StreamBuilder stream;
  for (const std::string& name : collidingNames(50'000))
    stream.record("TAGN", 'c', name).record("TAGV", 'L', 1);
  EXPECT_EQ(decodedWithinBounds(stream.bytes())["TAG "].dictionary().size(), 50'000u);
}

TEST(TagStreamDecoderHostile, LongNamesWithACommonBeginning) {
  StreamBuilder stream;
  for (int i = 0; i < 1000; ++i) {
    stream.record("REGN", 'c', std::string(4000, 'x') + std::to_string(1000 + i));
    stream.header("REGV", 0, 'c');
  }
  const Dictionary group = decodedWithinBounds(stream.bytes())["REG "].dictionary();
  EXPECT_EQ(group.size(), 1000u);
  EXPECT_TRUE(group.contains(std::string(4000, 'x') + "1999"));
  EXPECT_FALSE(group.contains(std::string(4000, 'x') + "2000"));
}

TEST(TagStreamDecoderHostile, NamesThatAreReplacedOverAndOver) {
  StreamBuilder stream;
  for (int i = 0; i < 1000; ++i) stream.record("TAGN", 'c', std::string(1000, '\xFF'));
  EXPECT_EQ(decodedWithinBounds(stream.bytes()), Dictionary());
}

TEST(TagStreamDecoderHostile, OneTagOverAndOver) {
  const Bytes stream = repeated(StreamBuilder().record("TAKE", 'B', 7).bytes(), 12 * 100'000);
  EXPECT_EQ(decodedWithinBounds(stream), (Dictionary{{"TAKE", 7}}));
}

// Payloads.

TEST(TagStreamDecoderHostile, LargestRecordThatDoesNotWrap) {
  StreamBuilder stream;
  stream.record("FREE", 'c', Bytes(0xFFFFF4, 0xAB)).record("TAKE", 'B', 1);
  const Dictionary tags = decodedWithinBounds(stream.bytes());
  EXPECT_EQ(keys(tags), (Names{"FREE", "TAKE"}));
  EXPECT_EQ(tags["FREE"], Value::data(Bytes(0xFFFFF4, 0xAB)));
}

TEST(TagStreamDecoderHostile, TextWithoutANulAtTheVeryEnd) {
  EXPECT_EQ(decoded({'R', 'E', 'E', 'L', 5, 0, 0, 'c', 'A', '0', '0', '1', '_'}),
            (Dictionary{{"REEL", "A001_"}}));
  EXPECT_EQ(decoded({'R', 'E', 'E', 'L', 9, 0, 0, 'c', 'A', '0', '0', '1', '_'}),
            (Dictionary{{"REEL", "A001_"}}));
  EXPECT_EQ(decoded({'K', 'W', 'R', 'd', 1, 0, 0, 'c', 0xC3}),
            (Dictionary{{"KWRd", Array::of("\xC3\x83")}}))
      << "a character cut off is a byte of ISO-8859-1";
}

TEST(TagStreamDecoderHostile, FloatsThatAreNotFinite) {
  StreamBuilder stream;
  const std::vector<std::uint32_t> bits = {0x7F800000, 0xFF800000, 0x7FC00000, 0xFFC00001,
                                           0x7F800001, 0x80000000, 0x00000001, 0x7F7FFFFF};
  Bytes payload;
  for (const std::uint32_t word : bits) {
    for (int shift = 0; shift < 32; shift += 8)
      payload.push_back(static_cast<std::uint8_t>(word >> shift));
  }
  stream.record("MASK", 'f', payload).record("SATU", 'f', Bytes{0, 0, 0xC0, 0x7F});
  const Dictionary tags = decoded(stream.bytes());
  EXPECT_TRUE(std::isnan(tags["SATU"].floatValue()));
  EXPECT_EQ(tags["SATU"].intValue(), 0);
  const Array mask = tags["MASK"].array();
  ASSERT_EQ(mask.size(), bits.size());
  for (std::size_t i = 0; i < bits.size(); ++i) {
    EXPECT_EQ(mask[i].kind(), Value::Kind::float32);
    EXPECT_EQ(mask[i].floatBits(), bits[i]);
  }
}

// Bytes without meaning: whatever they are, they are read within bounds.
TEST(TagStreamDecoderHostile, ArbitraryBytes) {
  std::uint32_t state = 1;
  const auto next = [&] {
    state = state * 1664525u + 1013904223u;  // a linear congruential generator
    return state >> 16;
  };
  const auto rows = tagRows();
  for (int round = 0; round < 3000; ++round) {
    StreamBuilder stream;
    while (next() % 12 != 0) {
      const std::array<char, 4> tag = charactersOf(rows[next() % rows.size()].tag);
      const std::uint32_t size = next() % 8 == 0 ? 0xFFFFFF - next() % 16 : next() % 40;
      stream.header({tag.data(), 4}, size, static_cast<char>(next() % 256));
      Bytes payload(next() % 40);
      for (std::uint8_t& byte : payload) byte = static_cast<std::uint8_t>(next() % 4 * 0x7F);
      stream.raw(payload);
      if (next() % 4 == 0) stream.marker(static_cast<std::uint16_t>(next()));
    }
    const auto length = next() % 2 == 0 ? 0x7FFFFFFF : std::int32_t(stream.bytes().size());
    Counter counter;
    decodeStream(stream.bytes(), length, nullptr, &counter);
    ASSERT_LE(counter.visits, stream.bytes().size());
    myGUID guid;
    decoded(stream.bytes(), length, &guid);
  }
}

// No memory.

TEST(TagStreamDecoderHostile, ShortageOfMemoryLeavesNothingBehind) {
  StreamBuilder inner, stream;
  inner.record("TAGN", 'c', "Caf\xE9").record("TAGV", 'L', 1);
  for (int i = 0; i < 100; ++i)
    stream.record("REGN", 'c', std::to_string(i))
        .record("REGV", 'L', i)
        .record("DSPm", 0, inner.bytes());
  const auto length = static_cast<std::int32_t>(stream.bytes().size());
  const Dictionary expected = decodeStream(stream.bytes(), length);

  std::size_t granted = 0;
  for (bool wasEnough = false; !wasEnough; ++granted) {
    ASSERT_LT(granted, 1000u);
    const MemoryMeter meter;
    Dictionary tags;
    {
      const MemoryShortage shortage(granted);
      try {
        tags = decodeStream(stream.bytes(), length);
        wasEnough = true;
      } catch (const std::bad_alloc&) {
        wasEnough = false;
      }
    }
    if (wasEnough) {
      EXPECT_EQ(tags, expected);
    } else {
      EXPECT_EQ(meter.held(), 0u) << granted;
    }
  }
  EXPECT_GT(granted, 1u) << "nothing was ever short";
}

TEST(TagStreamDecoderHostile, OrdinaryStreamTakesOneAllocation) {
  StreamBuilder stream;
  stream.record("PRCS", 'L', 1).record("REEL", 'c', "A001_C003").record("WBAL", 'f', Bytes(16, 0));
  const MemoryMeter meter;
  const Dictionary tags =
      decodeStream(stream.bytes(), static_cast<std::int32_t>(stream.bytes().size()));
  EXPECT_EQ(meter.allocations(), 1u);
  const Dictionary copy = tags;
  const Value reel = copy["REEL"];
  EXPECT_EQ(meter.allocations(), 1u) << "neither copies nor values taken out need memory";
}

}  // namespace
}  // namespace oxmv::test
