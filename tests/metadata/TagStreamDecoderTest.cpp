#include <limits>
#include <string>
#include <string_view>
#include <vector>

#include <gtest/gtest.h>

#include "oxmv/metadata/TagStreamDecoder.h"
#include "oxmv/values/Array.h"
#include "tests/support/Decoding.h"
#include "tests/support/Printing.h"
#include "tests/support/StreamBuilder.h"
#include "tests/support/WideLong.h"

namespace oxmv::test {
namespace {

using namespace std::string_view_literals;

Value dataOf(const Bytes& bytes) { return Value::data(bytes); }

TEST(TagStreamDecoder, OneTimecodeRecord) {
  EXPECT_EQ(decoded({'T', 'I', 'M', 'C', 4, 0, 0, 'c', '1', ':', '0', 0}),
            (Dictionary{{"TIMC", "1:0"}}));
}

TEST(TagStreamDecoder, EmptyStreamGivesAnEmptyDictionary) {
  EXPECT_EQ(decoded({}), Dictionary());
  EXPECT_EQ(decodeStream({}, 100), Dictionary());
}

TEST(TagStreamDecoder, LengthOf0OrLessGivesAnEmptyDictionary) {
  const Bytes stream = {'T', 'I', 'M', 'C', 4, 0, 0, 'c', '1', ':', '0', 0};
  for (const std::int32_t length : {0, -1, -12, std::numeric_limits<std::int32_t>::min()})
    EXPECT_EQ(decoded(stream, length), Dictionary()) << length;
}

TEST(TagStreamDecoder, SizeZeroTakesEightBytes) {
  EXPECT_EQ(decoded({'R', 'E', 'E', 'L', 0, 0, 0, 'c',  //
                     'T', 'A', 'K', 'E', 4, 0, 0, 'B', 7, 0, 0, 0}),
            (Dictionary{{"REEL", ""}, {"TAKE", 7}}));
}

TEST(TagStreamDecoder, SizeFiveTakesSixteenBytes) {
  EXPECT_EQ(decoded({'R', 'E', 'E', 'L', 5, 0, 0, 'c', 'A', '0', '0', '1', 0, 0, 0, 0,  //
                     'T', 'A', 'K', 'E', 4, 0, 0, 'B', 7,   0,   0,   0}),
            (Dictionary{{"REEL", "A001"}, {"TAKE", 7}}));
}

TEST(TagStreamDecoder, SizeIsUnsignedLittleEndianOf24Bits) {
  StreamBuilder stream;
  stream.header("FREE", 0x012345, 'c').raw(Bytes(0x012348, 0xAB));  // 3 bytes of padding
  stream.record("TAKE", 'B', 7);
  EXPECT_EQ(decoded(stream.bytes()),
            (Dictionary{{"FREE", dataOf(Bytes(0x012345, 0xAB))}, {"TAKE", 7}}));
}

TEST(TagStreamDecoder, UnknownTagBetweenLeavesNoTrace) {
  EXPECT_EQ(decoded({'R', 'E', 'E', 'L', 4, 0, 0, 'c', 'A', '3', 0, 0,              //
                     'Z', 'Z', 'Z', 'Z', 6, 0, 0, 'c', 1,   2,   3, 4, 5, 6, 0, 0,  //
                     'T', 'A', 'K', 'E', 4, 0, 0, 'B', 3,   0,   0, 0}),
            (Dictionary{{"REEL", "A3"}, {"TAKE", 3}}));
}

TEST(TagStreamDecoder, TagsAreCaseSensitive) {
  EXPECT_EQ(decoded({'t', 'i', 'm', 'c', 4, 0, 0, 'c', '1', ':', '0', 0}), Dictionary());
  EXPECT_EQ(decoded({'M', 'D', 'F', 'R', 4, 0, 0, 'B', 1, 0, 0, 0}), Dictionary());
  EXPECT_EQ(decoded({'M', 'D', 'F', 'r', 4, 0, 0, 'B', 1, 0, 0, 0}), (Dictionary{{"MDFr", 1}}));
}

TEST(TagStreamDecoder, KeysStandInTheOrderOfTheStream) {
  StreamBuilder stream;
  stream.record("TAKE", 'B', 1).record("REEL", 'c', "A").record("PRCS", 'L', 2);
  EXPECT_EQ(keys(decoded(stream.bytes())), (Names{"TAKE", "REEL", "PRCS"}));
}

TEST(TagStreamDecoder, LastOfATagWinsAndKeepsTheFirstPlace) {
  StreamBuilder stream;
  stream.record("REEL", 'c', "first").record("TAKE", 'B', 1).record("REEL", 'c', "second");
  const Dictionary tags = decoded(stream.bytes());
  EXPECT_EQ(tags, (Dictionary{{"REEL", "second"}, {"TAKE", 1}}));
  EXPECT_EQ(keys(tags), (Names{"REEL", "TAKE"}));
}

TEST(TagStreamDecoder, ResultOutlivesTheStream) {
  Value reel;
  {
    // decoded() gives the bytes back before it answers; here the dictionary goes as well.
    reel = decoded({'R', 'E', 'E', 'L', 4, 0, 0, 'c', 'A', '0', '0', '1'})["REEL"];
  }
  EXPECT_EQ(reel.text(), "A001");
}

// Float lists.

TEST(TagStreamDecoder, WhiteBalanceOfSize12IsIgnored) {
  EXPECT_EQ(decoded({'W', 'B', 'A',  'L',  12, 0, 0, 'f',                     //
                     0,   0,   0x80, 0x3F, 0,  0, 0, 0x40, 0, 0, 0x40, 0x40,  // 1, 2, 3
                     'T', 'A', 'K',  'E',  4,  0, 0, 'B',  3, 0, 0,    0}),
            (Dictionary{{"TAKE", 3}}));
}

TEST(TagStreamDecoder, WhiteBalanceOfSize16IsFourFloatsInOrder) {
  EXPECT_EQ(decoded({'W',  'B',  'A',  'L',  16, 0, 0, 'f',  //
                     0,    0,    0x80, 0x3F,                 // 1.0f
                     0x9A, 0x99, 0x99, 0x3F,                 // 1.2f
                     0,    0,    0x80, 0xBF,                 // -1.0f
                     0,    0,    0xC0, 0x3F}),               // 1.5f
            (Dictionary{{"WBAL", Array::of(1.0f, 1.2f, -1.0f, 1.5f)}}));
}

TEST(TagStreamDecoder, FloatListOfWrongSizeLeavesTheEarlierValue) {
  StreamBuilder stream;
  stream.header("DASF", 8, 'f').raw({0, 0, 0x80, 0x3F, 0, 0, 0, 0x40});
  stream.header("DASF", 12, 'f').raw(Bytes(12, 0));
  EXPECT_EQ(decoded(stream.bytes()), (Dictionary{{"DASF", Array::of(1.0f, 2.0f)}}));
}

TEST(TagStreamDecoder, FloatListIgnoredTakesNoPlace) {
  StreamBuilder stream;
  stream.header("DASF", 4, 'f').raw(Bytes(4, 0)).record("TAKE", 'B', 1);
  stream.header("DASF", 8, 'f').raw({0, 0, 0x80, 0x3F, 0, 0, 0, 0x40});
  EXPECT_EQ(keys(decoded(stream.bytes())), (Names{"TAKE", "DASF"}));
}

// Integer lists.

TEST(TagStreamDecoder, IntegerListOfSize2IsEmpty) {
  EXPECT_EQ(decoded({'B', 'A', 'D', 'P', 2, 0, 0, 'H', 1, 2, 0, 0}),
            (Dictionary{{"BADP", Array()}}));
  EXPECT_EQ(decoded({'B', 'A', 'D', 'P', 0, 0, 0, 'H'}), (Dictionary{{"BADP", Array()}}));
}

TEST(TagStreamDecoder, IntegerListTakesAQuarterOfItsSizeRoundedDown) {
  const Bytes payload = {1, 0, 0, 0, 0xFE, 0xFF, 0xFF, 0xFF, 3, 0, 0, 0, 4};
  for (const auto& [size, expected] :
       std::vector<std::pair<std::size_t, Array>>{{3, Array()},
                                                  {4, Array::of(1)},
                                                  {5, Array::of(1)},
                                                  {7, Array::of(1)},
                                                  {8, Array::of(1, -2)},
                                                  {11, Array::of(1, -2)},
                                                  {12, Array::of(1, -2, 3)},
                                                  {13, Array::of(1, -2, 3)}}) {
    StreamBuilder stream;
    const auto end = payload.begin() + static_cast<std::ptrdiff_t>(size);
    stream.record("GPST", 'H', Bytes(payload.begin(), end));
    EXPECT_EQ(decoded(stream.bytes()), (Dictionary{{"GPST", expected}})) << size;
  }
}

// Tags that may occur any number of times.

TEST(TagStreamDecoder, ThreeKeywordsGiveThreeTextsInOrder) {
  EXPECT_EQ(decoded({'K', 'W', 'R', 'd', 4, 0, 0, 'c', 'o', 'n', 'e', 0,  //
                     'K', 'W', 'R', 'd', 3, 0, 0, 'c', 't', 'w', 'o', 0,  //
                     'K', 'W', 'R', 'd', 5, 0, 0, 'c', 't', 'h', 'r', 'e', 'e', 0, 0, 0}),
            (Dictionary{{"KWRd", Array::of("one\0"sv, "two", "three")}}));
}

TEST(TagStreamDecoder, ElementOfSize0IsAnEmptyText) {
  EXPECT_EQ(decoded({'K', 'W', 'R', 'd', 0, 0, 0, 'c'}), (Dictionary{{"KWRd", Array::of("")}}));
}

TEST(TagStreamDecoder, ListsGatherAcrossOtherTagsAndStandWhereTheyBegan) {
  StreamBuilder stream;
  stream.record("SCPg", 'H', 1).record("LOCn", 'c', "here").record("SCPg", 'H', -2);
  stream.record("TAKE", 'B', 1).record("LOCn", 'c', "ther").record("SCPg", 'H', 3);
  const Dictionary tags = decoded(stream.bytes());
  EXPECT_EQ(tags,
            (Dictionary{
                {"SCPg", Array::of(1, -2, 3)}, {"LOCn", Array::of("here", "ther")}, {"TAKE", 1}}));
  EXPECT_EQ(keys(tags), (Names{"SCPg", "LOCn", "TAKE"}));
}

// Nested streams.

TEST(TagStreamDecoder, NestedStreamOfSize0StoresNothing) {
  EXPECT_EQ(decoded({'C', 'O', 'L', '1', 0, 0, 0, 0, 'T', 'A', 'K', 'E', 4, 0, 0, 'B', 3, 0, 0, 0}),
            (Dictionary{{"TAKE", 3}}));
}

TEST(TagStreamDecoder, NestedStreamIsADictionary) {
  EXPECT_EQ(decoded({'C', 'O', 'L', '1', 12, 0, 0, 0,                   //
                     'S', 'A', 'T', 'U', 4,  0, 0, 'f', 0, 0, 0, 0x3F,  // 0.5f
                     'T', 'A', 'K', 'E', 4,  0, 0, 'B', 3, 0, 0, 0}),
            (Dictionary{{"COL1", Dictionary{{"SATU", 0.5f}}}, {"TAKE", 3}}));
}

TEST(TagStreamDecoder, NestedStreamWithoutKnownTagsIsAnEmptyDictionary) {
  EXPECT_EQ(decoded({'C', 'O', 'L', '2', 8, 0, 0, 0, 'Z', 'Z', 'Z', 'Z', 0, 0, 0, 0}),
            (Dictionary{{"COL2", Dictionary()}}));
}

TEST(TagStreamDecoder, NestedStreamsNestFurther) {
  StreamBuilder inner, middle, outer;
  inner.record("SATU", 'f', 0.5f);
  middle.record("DSPm", 0, inner.bytes()).record("TAKE", 'B', 1);
  outer.record("COL1", 0, middle.bytes()).record("TAKE", 'B', 2);
  EXPECT_EQ(decoded(outer.bytes()),
            (Dictionary{
                {"COL1", Dictionary{{"DSPm", Array::of(Dictionary{{"SATU", 0.5f}})}, {"TAKE", 1}}},
                {"TAKE", 2}}));
}

TEST(TagStreamDecoder, DisplayListIsADictionaryARecordAlsoOfSize0) {
  StreamBuilder zoom, stream;
  zoom.record("ZOOM", 'f', 2.0f);
  stream.record("DSPm", 0, zoom.bytes()).header("DSPm", 0, 0).record("DSPm", 0, zoom.bytes());
  EXPECT_EQ(decoded(stream.bytes()),
            (Dictionary{{"DSPm", Array::of(Dictionary{{"ZOOM", 2.0f}}, Dictionary(),
                                           Dictionary{{"ZOOM", 2.0f}})}}));
}

TEST(TagStreamDecoder, ControlPointIsTwoIntegersAndANestedStream) {
  const Dictionary tags =
      decoded({'C', 'T', 'L', 'p', 20,   0,    0,    0,                    //
               10,  0,   0,   0,   0xFF, 0xFF, 0xFF, 0xFF,                 // 10, -1
               'S', 'A', 'T', 'U', 4,    0,    0,    'f',  0, 0, 0, 0x3F,  // 0.5f
               'C', 'T', 'L', 'p', 8,    0,    0,    0,                    //
               1,   2,   0,   0,   0,    0,    0,    0x80});
  EXPECT_EQ(
      tags,
      (Dictionary{{"CTLp", Array::of(Dictionary{{"SATU", 0.5f}, {"CTLPData", Array::of(10, -1)}},
                                     Dictionary{{"CTLPData", Array::of(0x0201, INT32_MIN)}})}}));
  EXPECT_EQ(keys(tags["CTLp"].array()[0].dictionary()), (Names{"SATU", "CTLPData"}));
}

TEST(TagStreamDecoder, ControlPointOfSizeBelow8HasNoNestedStream) {
  // Its two integers are there whatever the size says; the next record begins behind its size.
  EXPECT_EQ(
      decoded({'C', 'T', 'L', 'p', 0, 0, 0, 0, 'T', 'A', 'K', 'E', 4, 0, 0, 'B', 9, 0, 0, 0}),
      (Dictionary{{"CTLp", Array::of(Dictionary{{"CTLPData", Array::of(0x454B4154, 0x42000004)}})},
                  {"TAKE", 9}}));
  EXPECT_EQ(decoded({'C', 'T', 'L', 'p', 4, 0, 0, 0,   5, 0, 0, 0,  //
                     'T', 'A', 'K', 'E', 4, 0, 0, 'B', 9, 0, 0, 0}),
            (Dictionary{{"CTLp", Array::of(Dictionary{{"CTLPData", Array::of(5, 0x454B4154)}})},
                        {"TAKE", 9}}));
}

TEST(TagStreamDecoder, ControlPointEndsWithItsSize) {
  // The two integers count: the nested stream has 8 bytes fewer, and no room for what follows.
  EXPECT_EQ(
      decoded({'C', 'T', 'L', 'p', 16, 0, 0, 0,    //
               1,   0,   0,   0,   2,  0, 0, 0,    //
               'R', 'E', 'E', 'L', 0,  0, 0, 'c',  //
               'N', 'A', 'M', 'E', 0,  0, 0, 'c'}),
      (Dictionary{{"CTLp", Array::of(Dictionary{{"REEL", ""}, {"CTLPData", Array::of(1, 2)}})},
                  {"NAME", ""}}));
}

TEST(TagStreamDecoder, NothingThatANestedStreamHoldsLeaksOut) {
  StreamBuilder inner, stream;
  inner.record("REEL", 'c', "in").record("KWRd", 'c', "in  ");
  stream.record("KWRd", 'c', "out ").record("COL1", 0, inner.bytes()).record("KWRd", 'c', "out2");
  EXPECT_EQ(decoded(stream.bytes()),
            (Dictionary{{"KWRd", Array::of("out ", "out2")},
                        {"COL1", Dictionary{{"REEL", "in"}, {"KWRd", Array::of("in  ")}}}}));
}

// The identity.

TEST(TagStreamDecoder, GuidRecordIsDataAndTheIdentity) {
  if (!is64Bit) GTEST_SKIP();
  const Bytes image = {1,  2,  3,  4,  5,  6,  7,  8,  9,  10, 11, 12,
                       13, 14, 15, 16, 17, 18, 19, 20, 21, 22, 23, 24};
  StreamBuilder stream;
  stream.record("GUID", 'G', image);
  myGUID guid;
  EXPECT_EQ(decoded(stream.bytes(), std::nullopt, &guid), (Dictionary{{"GUID", dataOf(image)}}));
  EXPECT_EQ(guid,
            (myGUID{wide(0x0807060504030201u), 0x0A09, 0x0C0B, {13, 14, 15, 16, 17, 18, 19, 20}}));
}

TEST(TagStreamDecoder, GuidRecordInANestedStreamIsTheIdentityToo) {
  StreamBuilder inner, stream;
  inner.record("GUID", 'G', Bytes(24, 0x55));
  stream.record("GUID", 'G', Bytes(24, 0x11)).record("DSPm", 0, inner.bytes());
  myGUID guid;
  decoded(stream.bytes(), std::nullopt, &guid);
  EXPECT_EQ(guid.Data2, 0x5555);
  EXPECT_EQ(guid.Data4[7], 0x55);
}

TEST(TagStreamDecoder, StreamWithoutGuidRecordLeavesTheIdentity) {
  const myGUID before{1, 2, 3, {4}};
  myGUID guid = before;
  decoded({'T', 'I', 'M', 'C', 4, 0, 0, 'c', '1', ':', '0', 0}, std::nullopt, &guid);
  EXPECT_EQ(guid, before);
}

// Markers.

// The stream of the next tests: 12 bytes, the marker's 4, 12 bytes.
Bytes markedStream(std::uint16_t count) {
  StreamBuilder stream;
  stream.record("PRCS", 'L', 1).marker(count).record("TAKE", 'B', 2);
  return stream.bytes();
}

TEST(TagStreamDecoder, MarkerOf2LetsRecordsRunTwelveBytesPastTheLength) {
  EXPECT_EQ(decoded({'P',  'R',  'C',  'S',  4, 0, 0, 'L', 1, 0, 0, 0,  //
                     0xBF, 0xFE, 0x00, 0x02,                            // 8 bytes more
                     'T',  'A',  'K',  'E',  4, 0, 0, 'B', 2, 0, 0, 0},
                    16),
            (Dictionary{{"PRCS", 1}, {"TAKE", 2}}));
  EXPECT_EQ(decoded(markedStream(2), 15), (Dictionary{{"PRCS", 1}})) << "one byte too short";
  EXPECT_EQ(decoded(markedStream(1), 16), (Dictionary{{"PRCS", 1}})) << "raised too little";
}

TEST(TagStreamDecoder, MarkerIsNotCounted) {
  EXPECT_EQ(decoded(markedStream(0), 24), (Dictionary{{"PRCS", 1}, {"TAKE", 2}}));
  EXPECT_EQ(decoded(markedStream(0), 23), (Dictionary{{"PRCS", 1}}));
}

TEST(TagStreamDecoder, MarkerCountIsBigEndian) {
  StreamBuilder stream;
  stream.record("PRCS", 'L', 1).marker(0x0100).header("FREE", 0x3F8, 'c').raw(Bytes(0x3F8, 1));
  // 0x100 times 4 is 0x400: exactly the second record.
  EXPECT_EQ(keys(decoded(stream.bytes(), 12)), (Names{"PRCS"})) << "the length is used up before";
  EXPECT_EQ(keys(decoded(stream.bytes(), 13)), (Names{"PRCS", "FREE"}));
  EXPECT_EQ(witnessOf(stream.bytes(), 13).markers, (std::vector<Witness::Marker>{{12, 0x400, 0}}));
}

TEST(TagStreamDecoder, MarkerBehindTheLastRecordIsNotLookedFor) {
  EXPECT_EQ(decoded(markedStream(100), 12), (Dictionary{{"PRCS", 1}}));
}

TEST(TagStreamDecoder, EveryMarkerRaisesTheLimit) {
  StreamBuilder stream;
  stream.record("PRCS", 'L', 1).marker(3).record("TAKE", 'B', 2).marker(3).record("SHOT", 'B', 3);
  EXPECT_EQ(decoded(stream.bytes(), 13), (Dictionary{{"PRCS", 1}, {"TAKE", 2}, {"SHOT", 3}}));
}

TEST(TagStreamDecoder, OnlyOneMarkerIsLookedForAtEachStep) {
  // The second marker's bytes are the tag of a record of size 0.
  const Bytes stream = {'P',  'R',  'C', 'S', 4, 0, 0, 'L', 1, 0, 0, 0,  //
                        0xBF, 0xFE, 0,   1,                              //
                        0xBF, 0xFE, 0,   1,   0, 0, 0, 0,                //
                        'T',  'A',  'K', 'E', 4, 0, 0, 'B', 2, 0, 0, 0};
  EXPECT_EQ(decoded(stream, 28), (Dictionary{{"PRCS", 1}, {"TAKE", 2}}));
  EXPECT_EQ(decoded(stream, 27), (Dictionary{{"PRCS", 1}})) << "raised by one marker alone";
  EXPECT_EQ(witnessOf(stream, 28).markers, (std::vector<Witness::Marker>{{12, 4, 0}}));
}

TEST(TagStreamDecoder, MarkerBytesAtTheStartAreATag) {
  const Bytes stream = {0xBF, 0xFE, 'A', 'B', 4, 0, 0, 'c', 0, 0, 0, 0,  //
                        'P',  'R',  'C', 'S', 4, 0, 0, 'L', 1, 0, 0, 0};
  EXPECT_EQ(decoded(stream), (Dictionary{{"PRCS", 1}}));
  EXPECT_EQ(witnessOf(stream).markers, std::vector<Witness::Marker>{});
}

TEST(TagStreamDecoder, OneByteOfAMarkerIsNone) {
  const Bytes stream = {'P',  'R',  'C', 'S', 4, 0, 0, 'L', 1, 0, 0, 0,  //
                        0xBF, 0xFF, 0,   9,   0, 0, 0, 0,                //
                        0xBE, 0xFE, 0,   9,   0, 0, 0, 0,                //
                        'T',  'A',  'K', 'E', 4, 0, 0, 'B', 2, 0, 0, 0};
  EXPECT_EQ(decoded(stream), (Dictionary{{"PRCS", 1}, {"TAKE", 2}}));
  EXPECT_EQ(witnessOf(stream).markers, std::vector<Witness::Marker>{});
}

TEST(TagStreamDecoder, MarkerInANestedStreamRaisesThatStreamsLimitOnly) {
  StreamBuilder inner, stream;
  inner.record("PRCS", 'L', 1).marker(9).record("TAKE", 'B', 2);
  stream.record("COL1", 0, inner.bytes()).record("SHOT", 'B', 3).record("SCEN", 'B', 4);
  EXPECT_EQ(decoded(stream.bytes(), 48),
            (Dictionary{{"COL1", Dictionary{{"PRCS", 1}, {"TAKE", 2}}}, {"SHOT", 3}}));
}

TEST(TagStreamDecoder, MarkerInANestedStreamReachesNoByteBehindIt) {
  StreamBuilder inner, stream;
  inner.record("PRCS", 'L', 1).marker(100);
  stream.record("COL1", 0, inner.bytes()).record("TAKE", 'B', 2);
  EXPECT_EQ(decoded(stream.bytes()), (Dictionary{{"COL1", Dictionary{{"PRCS", 1}}}, {"TAKE", 2}}));
}

// The length, and the bytes that are there.

TEST(TagStreamDecoder, RecordThatEndsWithTheLengthIsRead) {
  StreamBuilder stream;
  stream.record("PRCS", 'L', 1).record("REEL", 'c', "A0001");  // 12 bytes and 16, 13 of them used
  EXPECT_EQ(decoded(stream.bytes(), 25), (Dictionary{{"PRCS", 1}, {"REEL", "A0001"}}));
  EXPECT_EQ(decoded(stream.bytes(), 24), (Dictionary{{"PRCS", 1}}));
}

TEST(TagStreamDecoder, PaddingNeedNotBeThere) {
  StreamBuilder stream;
  stream.record("PRCS", 'L', 1).record("REEL", 'c', "A0001").dropLast(3);
  EXPECT_EQ(decoded(stream.bytes()), (Dictionary{{"PRCS", 1}, {"REEL", "A0001"}}));
  stream.dropLast(1);
  EXPECT_EQ(decoded(stream.bytes()), (Dictionary{{"PRCS", 1}}));
}

TEST(TagStreamDecoder, PartialRecordIsNotRead) {
  StreamBuilder stream;
  stream.record("PRCS", 'L', 1).record("TAKE", 'B', 2).record("SHOT", 'B', 3);
  for (std::size_t dropped = 1; dropped <= 11; ++dropped) {
    stream.dropLast(1);
    EXPECT_EQ(decoded(stream.bytes()), (Dictionary{{"PRCS", 1}, {"TAKE", 2}})) << dropped;
  }
}

TEST(TagStreamDecoder, KeepsReadingTheFirstRecordWhateverItsSize) {
  const Bytes stream = {'R', 'E', 'E', 'L', 8,   0,   0, 'c', 'A', '0', '0', '1', '_', 'C',
                        0,   0,   'T', 'A', 'K', 'E', 4, 0,   0,   'B', 2,   0,   0,   0};
  for (const std::int32_t length : {1, 7, 8, 12, 16})
    EXPECT_EQ(decoded(stream, length), (Dictionary{{"REEL", "A001_C"}})) << length;
}

TEST(TagStreamDecoder, KeepsSteppingOverThePaddingThatRawDataLack) {
  // Five bytes of data and no padding, as the format's writer has it: the reader meets the next
  // record 3 bytes late, where a size stands that passes the end.
  StreamBuilder stream;
  stream.header("FREE", 5, 'c').raw({1, 2, 3, 4, 5}).record("TAKE", 'B', 2).raw(Bytes(8, 0));
  EXPECT_EQ(keys(decoded(stream.bytes())), (Names{"FREE"}));
}

}  // namespace
}  // namespace oxmv::test
