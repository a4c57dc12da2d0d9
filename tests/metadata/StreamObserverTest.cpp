#include <set>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

#include <gtest/gtest.h>

#include "oxmv/metadata/StreamObserver.h"
#include "oxmv/metadata/TagStreamDecoder.h"
#include "oxmv/values/Array.h"
#include "tests/support/Decoding.h"
#include "tests/support/Printing.h"
#include "tests/support/StreamBuilder.h"

namespace oxmv::test {
namespace {

using namespace std::string_view_literals;
using Visits = std::vector<Witness::Visit>;
using Skips = std::vector<Witness::Skip>;
using Stops = std::vector<Witness::Stop>;
using Markers = std::vector<Witness::Marker>;
using Values = std::vector<std::pair<std::string, Value>>;

constexpr SkipReason allReasons[] = {
    SkipReason::unknownTag,       SkipReason::wrongSize,        SkipReason::shortPayload,
    SkipReason::emptyNested,      SkipReason::valueWithoutName, SkipReason::nameWithoutValue,
    SkipReason::tooDeep,          SkipReason::incompleteRecord, SkipReason::truncatedRecord,
    SkipReason::cutHeader,        SkipReason::cutMarker,        SkipReason::lengthZero,
    SkipReason::overlappingRecord};

// Messages, JSON and scripts rely on these.
TEST(StreamObserver, CodesOfTheReasonsStay) {
  EXPECT_EQ(codeOf(SkipReason::unknownTag), "unknown-tag");
  EXPECT_EQ(codeOf(SkipReason::wrongSize), "wrong-size");
  EXPECT_EQ(codeOf(SkipReason::shortPayload), "short-payload");
  EXPECT_EQ(codeOf(SkipReason::emptyNested), "empty-nested");
  EXPECT_EQ(codeOf(SkipReason::valueWithoutName), "value-without-name");
  EXPECT_EQ(codeOf(SkipReason::nameWithoutValue), "name-without-value");
  EXPECT_EQ(codeOf(SkipReason::tooDeep), "too-deep");
  EXPECT_EQ(codeOf(SkipReason::incompleteRecord), "incomplete-record");
  EXPECT_EQ(codeOf(SkipReason::truncatedRecord), "truncated-record");
  EXPECT_EQ(codeOf(SkipReason::cutHeader), "cut-header");
  EXPECT_EQ(codeOf(SkipReason::cutMarker), "cut-marker");
  EXPECT_EQ(codeOf(SkipReason::lengthZero), "length-zero");
  EXPECT_EQ(codeOf(SkipReason::overlappingRecord), "overlapping-record");
}

TEST(StreamObserver, EveryReasonHasWordsOfItsOwn) {
  std::set<std::string_view> words;
  for (const SkipReason reason : allReasons) {
    EXPECT_NE(describe(reason).find(' '), std::string_view::npos) << codeOf(reason);
    words.insert(describe(reason));
  }
  EXPECT_EQ(words.size(), std::size(allReasons));
}

// Records and values.

TEST(StreamObserver, HearsOfEveryRecordInOrder) {
  StreamBuilder inner, stream;
  inner.record("SATU", 'f', 0.5f);
  stream.record("TIMC", 'c', "01:02").record("COL1", 0, inner.bytes()).record("ZZZZ", 'x', "??");
  stream.record("PRCS", 'L', 3);
  const Witness witness = witnessOf(stream.bytes());
  EXPECT_EQ(witness.visits, (Visits{{0, "TIMC", 5, 'c', 0},
                                    {16, "COL1", 12, 0, 0},
                                    {24, "SATU", 4, 'f', 1},
                                    {36, "ZZZZ", 2, 'x', 0},
                                    {48, "PRCS", 4, 'L', 0}}));
  EXPECT_EQ(witness.stops, Stops{}) << "the stream ends where its length says";
}

TEST(StreamObserver, HearsEveryValueAsItIsRead) {
  StreamBuilder inner, stream;
  inner.record("SATU", 'f', 0.5f);
  stream.record("TIMC", 'c', "1:0\0"sv).record("TAKE", 'B', 3).record("FREE", 'c', Bytes{1, 2});
  stream.record("DASF", 'f', Bytes{0, 0, 0x80, 0x3F, 0, 0, 0, 0x40});
  stream.record("BADP", 'H', 7).record("KWRd", 'c', "a\0"sv).record("SCPg", 'H', 8);
  stream.record("COL1", 0, inner.bytes()).record("TAGN", 'c', "n\0"sv).record("TAGV", 'c', "v\0"sv);
  stream.record("REGN", 'c', "Caf\xE9").record("REGV", 'L', 9);
  EXPECT_EQ(witnessOf(stream.bytes()).values, (Values{{"TIMC", "1:0"},
                                                      {"TAKE", 3},
                                                      {"FREE", Value::data(Bytes{1, 2})},
                                                      {"DASF", Array::of(1.0f, 2.0f)},
                                                      {"BADP", Array::of(7)},
                                                      {"KWRd", "a\0"sv},
                                                      {"SCPg", 8},
                                                      {"SATU", 0.5f},
                                                      {"TAGN", "n"},
                                                      {"TAGV", "v"},
                                                      {"REGN", "Caf\xC3\xA9"},
                                                      {"REGV", 9}}));
}

TEST(StreamObserver, RecordHasItsLengthRowAndPayload) {
  class Checker final : public StreamObserver {
   public:
    int heard = 0;
    void onRecord(const Record& record) override {
      ++heard;
      if (record.tag == "REEL"_tag) {
        EXPECT_EQ(record.length, 16u);
        EXPECT_EQ(record.payload.size(), 5u);
        EXPECT_EQ(record.payload[4], '1');
        ASSERT_NE(record.row, nullptr);
        EXPECT_EQ(record.row->label, "Reel name");
      } else {
        EXPECT_EQ(record.tag, "ZZZZ"_tag);
        EXPECT_EQ(record.length, 4u) << "wrapped";
        EXPECT_EQ(record.payload.size(), 3u) << "as much as is there";
        EXPECT_EQ(record.row, nullptr);
      }
    }
  } checker;
  StreamBuilder reel, cut;
  reel.record("REEL", 'c', "A0001");
  cut.header("ZZZZ", 0xFFFFFC, 'c').raw({1, 2, 3});
  decodeStream(reel.bytes(), 16, nullptr, &checker);
  decodeStream(cut.bytes(), 11, nullptr, &checker);
  EXPECT_EQ(checker.heard, 2);
}

// What leaves no trace.

TEST(StreamObserver, UnknownTag) {
  StreamBuilder stream;
  stream.record("ZZZZ", 'c', "?").record("GHTL", 'H', 1);
  const Witness witness = witnessOf(stream.bytes());
  EXPECT_EQ(witness.skips,
            (Skips{{0, "ZZZZ", SkipReason::unknownTag}, {12, "GHTL", SkipReason::unknownTag}}));
  EXPECT_EQ(witness.values, Values{});
}

TEST(StreamObserver, WrongSize) {
  StreamBuilder stream;
  stream.record("PRCS", 'L', 1).record("WBAL", 'f', Bytes(12, 0));
  EXPECT_EQ(witnessOf(stream.bytes()).skips, (Skips{{12, "WBAL", SkipReason::wrongSize}}));
}

TEST(StreamObserver, ShortPayload) {
  StreamBuilder number, point, group;
  number.record("PRCS", 'L', 1).header("UFRM", 3, 'L').raw(Bytes(3, 0));
  EXPECT_EQ(witnessOf(number.bytes()).skips, (Skips{{12, "UFRM", SkipReason::shortPayload}}));
  point.header("CTLp", 4, 0).raw(Bytes(4, 0));
  EXPECT_EQ(witnessOf(point.bytes()).skips, (Skips{{0, "CTLp", SkipReason::shortPayload}}));
  // The name goes on waiting, in vain.
  group.record("TAGN", 'c', "name").header("TAGV", 1, 'L').raw({1});
  EXPECT_EQ(witnessOf(group.bytes()).skips, (Skips{{12, "TAGV", SkipReason::shortPayload},
                                                   {0, "TAGN", SkipReason::nameWithoutValue}}));
}

TEST(StreamObserver, EmptyNested) {
  StreamBuilder stream;
  stream.header("COL1", 0, 0).header("DSPm", 0, 0).header("COL2", 0, 0);
  EXPECT_EQ(witnessOf(stream.bytes()).skips,
            (Skips{{0, "COL1", SkipReason::emptyNested}, {16, "COL2", SkipReason::emptyNested}}));
}

TEST(StreamObserver, ValueWithoutName) {
  StreamBuilder stream;
  stream.record("TAGV", 'L', 1).record("REGN", 'c', "name").record("REGV", 'L', 1);
  stream.record("REGV", 'L', 2);
  EXPECT_EQ(witnessOf(stream.bytes()).skips, (Skips{{0, "TAGV", SkipReason::valueWithoutName},
                                                    {36, "REGV", SkipReason::valueWithoutName}}));
}

TEST(StreamObserver, NameWithoutValue) {
  StreamBuilder inner, stream;
  inner.record("REGN", 'c', "in  ");
  stream.record("TAGN", 'c', "old ").record("TAGN", 'c', "new ").record("TAGV", 'L', 1);
  stream.record("COL1", 0, inner.bytes()).record("REGN", 'c', "last").record("PRCS", 'L', 1);
  EXPECT_EQ(witnessOf(stream.bytes()).skips, (Skips{{0, "TAGN", SkipReason::nameWithoutValue},
                                                    {44, "REGN", SkipReason::nameWithoutValue},
                                                    {56, "REGN", SkipReason::nameWithoutValue}}));
}

TEST(StreamObserver, TooDeep) {
  Bytes level;
  for (int i = 0; i < 65; ++i) level = StreamBuilder().record("COL1", 0, level).bytes();
  const Witness witness = witnessOf(level);
  EXPECT_EQ(witness.skips, (Skips{{63 * 8, "COL1", SkipReason::tooDeep}}));
  EXPECT_EQ(witness.visits.size(), 64u);
  EXPECT_EQ(witness.visits.back().level, 63);
}

// Why a walk ends before its bytes do.

TEST(StreamObserver, IncompleteRecord) {
  StreamBuilder stream;
  stream.header("FREE", 9, 'c').raw(Bytes(5, 0));
  const Witness witness = witnessOf(stream.bytes());
  EXPECT_EQ(witness.stops, (Stops{{0, 13, 0, SkipReason::incompleteRecord, "FREE"}}));
  EXPECT_EQ(witness.visits.size(), 1u) << "the walk came to it";
  EXPECT_EQ(witness.values, Values{});
}

TEST(StreamObserver, TruncatedRecord) {
  StreamBuilder stream;
  stream.record("PRCS", 'L', 1).header("FREE", 9, 'c').raw(Bytes(5, 0));
  const Witness witness = witnessOf(stream.bytes());
  EXPECT_EQ(witness.stops, (Stops{{12, 25, 0, SkipReason::truncatedRecord, "FREE"}}));
  EXPECT_EQ(witness.visits.size(), 1u) << "the walk did not go on to it";
}

TEST(StreamObserver, CutHeader) {
  StreamBuilder stream;
  stream.record("PRCS", 'L', 1).raw({'F', 'R', 'E', 'E', 0});
  EXPECT_EQ(witnessOf(stream.bytes()).stops, (Stops{{12, 17, 0, SkipReason::cutHeader, ""}}));
  EXPECT_EQ(witnessOf({'F', 'R'}).stops, (Stops{{0, 2, 0, SkipReason::cutHeader, ""}}));
}

TEST(StreamObserver, CutHeaderOfALengthThatPromisesMore) {
  StreamBuilder stream;
  stream.record("REEL", 'c', "A0001").dropLast(3);  // the padding
  EXPECT_EQ(witnessOf(stream.bytes(), 100).stops, (Stops{{13, 13, 0, SkipReason::cutHeader, ""}}));
}

TEST(StreamObserver, CutMarker) {
  StreamBuilder stream;
  stream.record("PRCS", 'L', 1).raw({0xBF, 0xFE, 0});
  EXPECT_EQ(witnessOf(stream.bytes()).stops, (Stops{{12, 15, 0, SkipReason::cutMarker, ""}}));
}

TEST(StreamObserver, MarkerAtTheVeryEndIsWhole) {
  StreamBuilder stream;
  stream.record("PRCS", 'L', 1).marker(2);
  const Witness witness = witnessOf(stream.bytes());
  EXPECT_EQ(witness.markers, (Markers{{12, 8, 0}}));
  EXPECT_EQ(witness.stops, (Stops{{16, 16, 0, SkipReason::cutHeader, ""}}));
}

TEST(StreamObserver, LengthZero) {
  StreamBuilder stream;
  stream.record("TIMB", 'B', 1).marker(0).header("PRCS", 0xFFFFF5, 'L').raw(Bytes(8, 0));
  const Witness witness = witnessOf(stream.bytes(), 0x1FFFFFF);
  EXPECT_EQ(witness.stops, (Stops{{16, 32, 0, SkipReason::lengthZero, "PRCS"}}));
  EXPECT_EQ(witness.visits.size(), 2u) << "it was read";
}

TEST(StreamObserver, OverlappingRecord) {
  StreamBuilder stream;
  stream.header("ZZZZ", 0xFFFFFD, 'c').header("PRCS", 0xFFFFFD, 'L').raw(Bytes(24, 0));
  const Witness witness = witnessOf(stream.bytes(), 0x1FFFFFF);
  EXPECT_EQ(witness.stops, (Stops{{8, 40, 0, SkipReason::overlappingRecord, "PRCS"}}));
  EXPECT_EQ(witness.visits.size(), 1u);
}

TEST(StreamObserver, StopOfANestedStreamCountsFromTheOutermost) {
  StreamBuilder inner, stream;
  inner.record("PRCS", 'L', 1).raw({1, 2, 3});
  stream.record("TIMB", 'B', 1).record("COL1", 0, inner.bytes()).record("TAKE", 'B', 1);
  const Witness witness = witnessOf(stream.bytes());
  EXPECT_EQ(witness.stops, (Stops{{32, 35, 1, SkipReason::cutHeader, ""}}));
  EXPECT_EQ(witness.visits.back().tag, "TAKE") << "the walk around it goes on";
}

// Markers.

TEST(StreamObserver, HearsOfMarkersWithOffsetBytesAndLevel) {
  StreamBuilder inner, stream;
  inner.record("PRCS", 'L', 1).marker(2).record("TAKE", 'B', 1);
  stream.record("TIMB", 'B', 1).marker(0x0102).record("COL1", 0, inner.bytes());
  EXPECT_EQ(witnessOf(stream.bytes()).markers, (Markers{{12, 4 * 0x0102, 0}, {36, 8, 1}}));
}

// The observer itself.

TEST(StreamObserver, NeedNotListenToAnything) {
  class Deaf final : public StreamObserver {
  } deaf;
  StreamBuilder stream;
  stream.record("PRCS", 'L', 1).marker(1).record("ZZZZ", 'L', 1).raw({1});
  EXPECT_EQ(decodeStream(stream.bytes(), 100, nullptr, &deaf), (Dictionary{{"PRCS", 1}}));
}

TEST(StreamObserver, ValuesOutliveTheDecoding) {
  Witness witness = witnessOf({'R', 'E', 'E', 'L', 4, 0, 0, 'c', 'A', '0', '0', '1'});
  ASSERT_EQ(witness.values.size(), 1u);
  EXPECT_EQ(witness.values[0].second.text(), "A001");
}

TEST(StreamObserver, ExceptionEndsTheDecodingAndReachesTheCaller) {
  class Thrower final : public StreamObserver {
   public:
    void onRecord(const Record& record) override {
      if (record.tag == "TAKE"_tag) throw std::runtime_error("enough");
    }
  } thrower;
  StreamBuilder inner, stream;
  inner.record("TAKE", 'B', 1);
  stream.record("PRCS", 'L', 1).record("COL1", 0, inner.bytes());
  EXPECT_THROW(decodeStream(stream.bytes(), 100, nullptr, &thrower), std::runtime_error);
}

}  // namespace
}  // namespace oxmv::test
