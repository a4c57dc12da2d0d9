// What is read of records that are not whole, whose payload is too short for their tag, or whose
// length wraps.

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

// Headers and markers that are cut off.

TEST(TagStreamDecoderLenience, HeaderOfFewerThan8BytesEndsTheWalk) {
  const Bytes stream = {'R', 'E', 'E', 'L', 0, 0, 0};
  for (std::size_t size = 0; size <= stream.size(); ++size) {
    const Bytes cut(stream.begin(), stream.begin() + static_cast<std::ptrdiff_t>(size));
    EXPECT_EQ(decoded(cut, 100), Dictionary()) << size;
    const Bytes after = StreamBuilder().record("PRCS", 'L', 1).raw(cut).bytes();
    EXPECT_EQ(decoded(after, 100), (Dictionary{{"PRCS", 1}})) << size;
  }
}

TEST(TagStreamDecoderLenience, MarkerOfFewerThan4BytesEndsTheWalk) {
  const Bytes marker = {0xBF, 0xFE, 0};
  for (std::size_t size = 1; size <= marker.size(); ++size) {
    StreamBuilder stream;
    stream.record("PRCS", 'L', 1).raw(Bytes(marker.begin(), marker.begin() + std::ptrdiff_t(size)));
    EXPECT_EQ(decoded(stream.bytes()), (Dictionary{{"PRCS", 1}})) << size;
  }
}

// A first record that is not whole, given as a length that promises more.

Bytes cutRecord(std::string_view tag, char type, std::uint32_t size, const Bytes& there) {
  return StreamBuilder().header(tag, size, type).raw(there).bytes();
}

TEST(TagStreamDecoderLenience, CutTextIsReadToTheEnd) {
  EXPECT_EQ(decoded(cutRecord("REEL", 'c', 100, bytesOf("A001"))), (Dictionary{{"REEL", "A001"}}));
  EXPECT_EQ(decoded(cutRecord("REEL", 'c', 100, bytesOf("A0\0001"sv))),
            (Dictionary{{"REEL", "A0"}}));
  EXPECT_EQ(decoded(cutRecord("REEL", 'c', 100, {})), (Dictionary{{"REEL", ""}}));
}

TEST(TagStreamDecoderLenience, CutNumberNeedsItsOwnBytesOnly) {
  EXPECT_EQ(decoded(cutRecord("PRCS", 'L', 100, {1, 2, 0, 0})), (Dictionary{{"PRCS", 0x0201}}));
  EXPECT_EQ(decoded(cutRecord("TAKE", 'B', 100, {1, 2})), (Dictionary{{"TAKE", 0x0201}}));
  EXPECT_EQ(decoded(cutRecord("TIMB", 'B', 100, {25})), (Dictionary{{"TIMB", 25}}));
  EXPECT_EQ(decoded(cutRecord("SATU", 'f', 100, {0, 0, 0, 0x3F})), (Dictionary{{"SATU", 0.5f}}));
  EXPECT_EQ(decoded(cutRecord("SCPg", 'H', 100, {1, 2, 0, 0})),
            (Dictionary{{"SCPg", Array::of(0x0201)}}));
}

TEST(TagStreamDecoderLenience, CutNumberWithoutItsOwnBytesIsNotStored) {
  EXPECT_EQ(decoded(cutRecord("PRCS", 'L', 4, {1, 2, 3})), Dictionary());
  EXPECT_EQ(decoded(cutRecord("TAKE", 'B', 4, {1})), Dictionary());
  EXPECT_EQ(decoded(cutRecord("TIMB", 'B', 4, {})), Dictionary());
  EXPECT_EQ(decoded(cutRecord("SATU", 'f', 4, {1, 2, 3})), Dictionary());
  EXPECT_EQ(decoded(cutRecord("SCPg", 'H', 4, {1, 2, 3})), Dictionary());
}

// Whatever takes its whole payload: each of these is whole with 16 bytes, and nothing with 15.
struct Whole {
  std::string_view tag;
  char type;
};
constexpr Whole wholePayloads[] = {{"FREE", 'c'}, {"BADP", 'H'}, {"WBAL", 'f'}, {"GUID", 'G'},
                                   {"COL1", 0},   {"KWRd", 'c'}, {"DSPm", 0},   {"CTLp", 0}};

TEST(TagStreamDecoderLenience, CutPayloadThatHasToBeWholeStoresNothing) {
  for (const auto& [tag, type] : wholePayloads) {
    EXPECT_EQ(keys(decoded(cutRecord(tag, type, 16, Bytes(16, 1)))), (Names{std::string(tag)}));
    EXPECT_EQ(decoded(cutRecord(tag, type, 16, Bytes(15, 1))), Dictionary()) << tag;
    EXPECT_EQ(decoded(cutRecord(tag, type, 16, {})), Dictionary()) << tag;
  }
}

TEST(TagStreamDecoderLenience, CutNestedStreamIsNotWalked) {
  StreamBuilder stream;
  stream.header("COL1", 25, 0).record("PRCS", 'L', 1).record("TAKE", 'B', 1);
  EXPECT_EQ(decoded(stream.bytes()), Dictionary());
  EXPECT_EQ(witnessOf(stream.bytes()).visits.size(), 1u);
}

TEST(TagStreamDecoderLenience, CutGroupTextStoresNothing) {
  for (const auto& [name, value] : {std::pair("TAGN"sv, "TAGV"sv), {"REGN"sv, "REGV"sv}}) {
    // The marker lets the value begin though the length is used up.
    StreamBuilder stream;
    stream.record(name, 'c', "name").marker(100).header(value, 9, 'c').raw(bytesOf("12345678"));
    EXPECT_EQ(decoded(stream.bytes()), Dictionary()) << name;
    EXPECT_EQ(decoded(stream.raw({'9'}).bytes()).size(), 1u) << name;
  }
}

TEST(TagStreamDecoderLenience, CutGroupNumberNeedsFourBytes) {
  for (const auto& [name, value, group] :
       {std::tuple("TAGN"sv, "TAGV"sv, "TAG "sv), {"REGN"sv, "REGV"sv, "REG "sv}}) {
    StreamBuilder stream;
    stream.record(name, 'c', "name").marker(100).header(value, 9, 'L').raw({5, 0, 0});
    EXPECT_EQ(decoded(stream.bytes()), Dictionary()) << name;
    EXPECT_EQ(decoded(stream.raw({0}).bytes()), (Dictionary{{group, Dictionary{{"name", 5}}}}));
  }
}

TEST(TagStreamDecoderLenience, CutNameIsNoName) {
  for (const auto& [name, value] : {std::pair("TAGN"sv, "TAGV"sv), {"REGN"sv, "REGV"sv}}) {
    // A size that wraps to a length of 8: the value stands where the name's payload should be, but
    // the walk ends with the name.
    StreamBuilder stream;
    stream.header(name, 0xFFFFFD, 'c').record(value, 'L', 5);
    EXPECT_EQ(decoded(stream.bytes()), Dictionary()) << name;
  }
}

// The same behind a marker, which lets a record begin that ends behind the last byte.
TEST(TagStreamDecoderLenience, CutRecordBehindAMarkerIsReadAlike) {
  const auto behindMarker = [](const Bytes& record) {
    return StreamBuilder().record("BFMT", 'B', 1).marker(100).raw(record).bytes();
  };
  EXPECT_EQ(decoded(behindMarker(cutRecord("REEL", 'c', 100, bytesOf("A001")))),
            (Dictionary{{"BFMT", 1}, {"REEL", "A001"}}));
  EXPECT_EQ(decoded(behindMarker(cutRecord("PRCS", 'L', 100, {5, 0, 0, 0}))),
            (Dictionary{{"BFMT", 1}, {"PRCS", 5}}));
  for (const auto& [tag, type] : wholePayloads) {
    EXPECT_EQ(decoded(behindMarker(cutRecord(tag, type, 16, Bytes(15, 1)))),
              (Dictionary{{"BFMT", 1}}))
        << tag;
  }
}

// Payloads shorter than the number that the tag wants.

TEST(TagStreamDecoderLenience, NumberReadsBeyondItsPayload) {
  // Each takes the tag of the record that follows, or part of it.
  const auto followed = [](std::string_view tag, const Bytes& sizeAndPayload) {
    return StreamBuilder().raw(bytesOf(tag)).raw(sizeAndPayload).record("SHOT", 'B', 9).bytes();
  };
  EXPECT_EQ(decoded(followed("PRCS", {0, 0, 0, 'L'})),
            (Dictionary{{"PRCS", 0x544F4853}, {"SHOT", 9}}));  // "SHOT"
  EXPECT_EQ(decoded(followed("TAKE", {0, 0, 0, 'B'})), (Dictionary{{"TAKE", 0x4853}, {"SHOT", 9}}));
  EXPECT_EQ(decoded(followed("TIMB", {0, 0, 0, 'B'})), (Dictionary{{"TIMB", 0x53}, {"SHOT", 9}}));
  EXPECT_EQ(decoded(followed("SCPg", {0, 0, 0, 'H'})),
            (Dictionary{{"SCPg", Array::of(0x544F4853)}, {"SHOT", 9}}));
  EXPECT_EQ(decoded(followed("PRCS", {1, 0, 0, 'L', 7, 0xAA, 0xBB, 0xCC})),
            (Dictionary{{"PRCS", static_cast<std::int32_t>(0xCCBBAA07)}, {"SHOT", 9}}))
      << "the padding counts";
}

TEST(TagStreamDecoderLenience, NumberReadsBeyondTheLength) {
  EXPECT_EQ(decoded({'P', 'R', 'C', 'S', 0, 0, 0, 'L', 5, 0, 0, 0}, 8), (Dictionary{{"PRCS", 5}}));
}

TEST(TagStreamDecoderLenience, NumberWithoutItsBytesIsNotStored) {
  EXPECT_EQ(decoded({'P', 'R', 'C', 'S', 0, 0, 0, 'L'}), Dictionary());
  EXPECT_EQ(decoded({'P', 'R', 'C', 'S', 3, 0, 0, 'L', 1, 0, 0}), Dictionary());
  EXPECT_EQ(decoded({'T', 'A', 'K', 'E', 1, 0, 0, 'B', 1}), Dictionary());
  EXPECT_EQ(decoded({'T', 'I', 'M', 'B', 0, 0, 0, 'B'}), Dictionary());
}

TEST(TagStreamDecoderLenience, NumberNotStoredLeavesTheEarlierValue) {
  StreamBuilder stream;
  stream.record("PRCS", 'L', 1).header("PRCS", 3, 'L').raw({2, 0, 0});
  EXPECT_EQ(decoded(stream.bytes()), (Dictionary{{"PRCS", 1}}));
}

TEST(TagStreamDecoderLenience, NumberInANestedStreamReadsNothingBehindThatStream) {
  StreamBuilder stream;
  stream.header("COL1", 8, 0).header("PRCS", 0, 'L').record("TAKE", 'B', 1);
  EXPECT_EQ(decoded(stream.bytes()), (Dictionary{{"COL1", Dictionary()}, {"TAKE", 1}}));
}

TEST(TagStreamDecoderLenience, ControlPointWithoutItsIntegersIsNotStored) {
  EXPECT_EQ(decoded({'C', 'T', 'L', 'p', 0, 0, 0, 0}), Dictionary());
  EXPECT_EQ(decoded({'C', 'T', 'L', 'p', 4, 0, 0, 0, 1, 0, 0, 0}), Dictionary());
  EXPECT_EQ(decoded({'C', 'T', 'L', 'p', 7, 0, 0, 0, 1, 0, 0, 0, 2, 0, 0}), Dictionary());
  // 3 bytes behind the stream's length, but there.
  EXPECT_EQ(decoded({'C', 'T', 'L', 'p', 5, 0, 0, 0, 1, 0, 0, 0, 2, 0, 0, 0}, 13),
            (Dictionary{{"CTLp", Array::of(Dictionary{{"CTLPData", Array::of(1, 2)}})}}));
}

// Texts.

TEST(TagStreamDecoderLenience, TextWithoutANulEndsWithItsSize) {
  EXPECT_EQ(decoded({'D', 'T', 'A', 'G', 4, 0, 0, 'F', 'A', 'B', 'C', 'D',  //
                     'T', 'A', 'K', 'E', 4, 0, 0, 'B', 1,   0,   0,   0}),
            (Dictionary{{"DTAG", "ABCD"}, {"TAKE", 1}}));
  EXPECT_EQ(decoded({'T', 'I', 'M', 'C', 3, 0, 0, 'c', '1', ':', '0', '!'}),
            (Dictionary{{"TIMC", "1:0"}}));
  EXPECT_EQ(decoded({'T', 'I', 'M', 'C', 4, 0, 0, 'c', 0, ':', '0', '!'}),
            (Dictionary{{"TIMC", ""}}));
}

TEST(TagStreamDecoderLenience, TextThatIsNotUtf8IsReadAsLatin1) {
  StreamBuilder stream;
  stream.record("REEL", 'c', "Caf\xE9").record("NAME", 'c', "Caf\xC3\xA9");
  stream.record("KWRd", 'c', "\xFF\0"sv).record("LOOK", 'c', "\xC3\xA9\0\xFF"sv);
  EXPECT_EQ(decoded(stream.bytes()), (Dictionary{{"REEL", "Caf\xC3\xA9"},
                                                 {"NAME", "Caf\xC3\xA9"},
                                                 {"KWRd", Array::of("\xC3\xBF\0"sv)},
                                                 {"LOOK", "\xC3\xA9"}}))
      << "what follows the NUL does not count";
}

// The identity.

TEST(TagStreamDecoderLenience, GuidTakesAsManyBytesAsItsStructureWhateverTheSize) {
  if (!is64Bit) GTEST_SKIP();
  Bytes stream = {'G', 'U', 'I', 'D', 16, 0,  0,  'G', 1,   2,   3,   4,   5, 6, 7, 8,
                  9,   10,  11,  12,  13, 14, 15, 16,  'R', 'E', 'E', 'L', 0, 0, 0, 'c'};
  myGUID guid;
  EXPECT_EQ(keys(decoded(stream, std::nullopt, &guid)), (Names{"GUID", "REEL"}));
  EXPECT_EQ(
      guid,
      (myGUID{wide(0x0807060504030201u), 0x0A09, 0x0C0B, {13, 14, 15, 16, 'R', 'E', 'E', 'L'}}));

  stream[4] = 0;  // size 0: no data, and the same identity
  myGUID other;
  EXPECT_EQ(decoded(stream, std::nullopt, &other)["GUID"], Value::data({}));
  EXPECT_EQ(other, guid);
}

TEST(TagStreamDecoderLenience, GuidTakesTheBytesThatAreThere) {
  if (!is64Bit) GTEST_SKIP();
  const myGUID before{
      wide(0xAAAAAAAAAAAAAAAAu), 0xAAAA, 0xAAAA, {0xAA, 0xAA, 0xAA, 0xAA, 0xAA, 0xAA, 0xAA, 0xAA}};
  myGUID guid = before;
  decoded(
      {'G', 'U', 'I', 'D', 16, 0, 0, 'G', 1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11, 12, 13, 14, 15, 16},
      std::nullopt, &guid);
  EXPECT_EQ(
      guid,
      (myGUID{
          wide(0x0807060504030201u), 0x0A09, 0x0C0B, {13, 14, 15, 16, 0xAA, 0xAA, 0xAA, 0xAA}}));

  guid = before;
  decoded({'G', 'U', 'I', 'D', 2, 0, 0, 'G', 1, 2}, std::nullopt, &guid);
  EXPECT_EQ(guid.Data1, wide(0xAAAAAAAAAAAA0201u));
}

TEST(TagStreamDecoderLenience, GuidInANestedStreamTakesThatStreamsBytes) {
  if (!is64Bit) GTEST_SKIP();
  StreamBuilder stream;
  stream.header("COL1", 24, 0).header("GUID", 16, 'G').raw(Bytes(16, 0x11));
  stream.record("FREE", 'c', Bytes(16, 0x22));
  myGUID guid{0, 0, 0, {0, 0, 0, 0, 0xAA, 0xAA, 0xAA, 0xAA}};
  decoded(stream.bytes(), std::nullopt, &guid);
  EXPECT_EQ(guid.Data4,
            (std::array<std::uint8_t, 8>{0x11, 0x11, 0x11, 0x11, 0xAA, 0xAA, 0xAA, 0xAA}));
}

TEST(TagStreamDecoderLenience, CutGuidChangesNoIdentity) {
  const myGUID before{1, 2, 3, {4}};
  for (std::size_t there = 0; there < 16; ++there) {
    myGUID guid = before;
    EXPECT_EQ(decoded(cutRecord("GUID", 'G', 16, Bytes(there, 9)), 100, &guid), Dictionary());
    EXPECT_EQ(guid, before) << there;
  }
}

// Lengths that wrap: sizes from 0xFFFFF5 give 0, from 0xFFFFF9 give 4, from 0xFFFFFD give 8.

TEST(TagStreamDecoderLenience, KeepsLengthWrappedTo0ReadOnce) {
  for (std::uint32_t size = 0xFFFFF5; size <= 0xFFFFF8; ++size) {
    StreamBuilder stream;
    stream.header("SCPg", size, 'H').raw({5, 0, 0, 0}).record("TAKE", 'B', 1);
    EXPECT_EQ(decoded(stream.bytes()), (Dictionary{{"SCPg", Array::of(5)}})) << size;
  }
}

TEST(TagStreamDecoderLenience, KeepsLengthWrappedTo4SteppedOver) {
  for (std::uint32_t size = 0xFFFFF9; size <= 0xFFFFFC; ++size) {
    // The next record begins with this one's size and type, and takes its size from the payload.
    StreamBuilder stream;
    stream.header("SCPg", size, 'H').raw({0, 0, 0, 5}).record("TAKE", 'B', 1);
    EXPECT_EQ(decoded(stream.bytes()), (Dictionary{{"SCPg", Array::of(0x05000000)}, {"TAKE", 1}}))
        << size;
  }
}

TEST(TagStreamDecoderLenience, KeepsLengthWrappedTo8SteppedOver) {
  for (std::uint32_t size = 0xFFFFFD; size <= 0xFFFFFF; ++size) {
    StreamBuilder stream;
    stream.header("SCPg", size, 'H').record("TAKE", 'B', 1);
    EXPECT_EQ(decoded(stream.bytes()),
              (Dictionary{{"SCPg", Array::of(0x454B4154)}, {"TAKE", 1}}))  // "TAKE"
        << size;
  }
}

TEST(TagStreamDecoderLenience, SizeBelowTheWrapGivesAFullLength) {
  StreamBuilder stream;
  stream.header("SCPg", 0xFFFFF4, 'H').record("TAKE", 'B', 1);
  EXPECT_EQ(decoded(stream.bytes()), (Dictionary{{"SCPg", Array::of(0x454B4154)}}));
}

TEST(TagStreamDecoderLenience, MarkerIsLookedForBehindAWrappedLength) {
  StreamBuilder stream;
  stream.header("SCPg", 0xFFFFFD, 'H').marker(2).record("TAKE", 'B', 1);
  EXPECT_EQ(decoded(stream.bytes(), 9), (Dictionary{{"SCPg", Array::of(0x0200FEBF)}}))
      << "9 and 8 more are fewer than 8 and 12";
  EXPECT_EQ(decoded(stream.bytes(), 12),
            (Dictionary{{"SCPg", Array::of(0x0200FEBF)}, {"TAKE", 1}}));
}

// Such payloads overlap: together they may take as many bytes as the outermost stream has.

constexpr std::int32_t longEnough = 0x1FFFFFF;  // a length that no record here passes

TEST(TagStreamDecoderLenience, OverlappingPayloadsTakeNoMoreThanTheStreamHas) {
  // 32 bytes. The first record takes the 24 behind it; the next would take 16, and 8 are left.
  StreamBuilder stream;
  for (int i = 0; i < 4; ++i) stream.header("REEL", 0xFFFFFD, 'c');
  EXPECT_EQ(decoded(stream.bytes(), longEnough), (Dictionary{{"REEL",
                                                              "REEL\xC3\xBD\xC3\xBF\xC3\xBF"
                                                              "cREEL\xC3\xBD\xC3\xBF\xC3\xBF"
                                                              "cREEL\xC3\xBD\xC3\xBF\xC3\xBF"
                                                              "c"}}));
  const Witness witness = witnessOf(stream.bytes(), longEnough);
  EXPECT_EQ(witness.visits.size(), 1u);
  EXPECT_EQ(witness.stops,
            (std::vector<Witness::Stop>{{8, 32, 0, SkipReason::overlappingRecord, "REEL"}}));
}

TEST(TagStreamDecoderLenience, OverlapIsCountedWhateverTheTag) {
  // 40 bytes. The unknown record takes 32; the next would take 24, and 8 are left.
  StreamBuilder stream;
  stream.header("ZZZZ", 0xFFFFFD, 'c').header("PRCS", 0xFFFFFD, 'L').raw(Bytes(24, 0));
  EXPECT_EQ(decoded(stream.bytes(), longEnough), Dictionary());
}

TEST(TagStreamDecoderLenience, OverlapIsCountedOverAllLevels) {
  // The first record takes all but 8 bytes, which leaves 8 for one in a nested stream.
  for (const std::size_t size : {8u, 9u}) {
    StreamBuilder inner, stream;
    inner.header("SCPg", 0xFFFFFF, 'H').raw(Bytes(size, 7));
    stream.header("ZZZZ", 0xFFFFFD, 'c').header("DSPm", 8 + static_cast<std::uint32_t>(size), 0);
    stream.raw(inner.bytes());
    const Dictionary element =
        size == 8 ? Dictionary{{"SCPg", Array::of(0x07070707)}} : Dictionary();
    EXPECT_EQ(decoded(stream.bytes(), longEnough), (Dictionary{{"DSPm", Array::of(element)}}))
        << size;
  }
}

TEST(TagStreamDecoderLenience, RecordsThatDoNotOverlapAreNotCounted) {
  // The first takes 20 of 28 bytes. The others are whole, and more than the 8 that are left.
  StreamBuilder stream;
  stream.header("ZZZZ", 0xFFFFFD, 'c').record("FREE", 'c', Bytes(12, 1));
  EXPECT_EQ(decoded(stream.bytes()), (Dictionary{{"FREE", Value::data(Bytes(12, 1))}}));
}

TEST(TagStreamDecoderLenience, LengthWrappedTo0IsNotCounted) {
  // Nothing follows such a record, so that it overlaps nothing: 8 bytes are left, and it takes 100.
  StreamBuilder stream;
  stream.header("ZZZZ", 0xFFFFFD, 'c').header("DSPm", 108, 0);
  stream.header("SCPg", 0xFFFFF5, 'H').raw(Bytes(100, 7));
  EXPECT_EQ(decoded(stream.bytes()),
            (Dictionary{{"DSPm", Array::of(Dictionary{{"SCPg", Array::of(0x07070707)}})}}));
}

}  // namespace
}  // namespace oxmv::test
