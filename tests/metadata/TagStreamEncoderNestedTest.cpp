// Streams within streams.

#include <string>
#include <string_view>
#include <vector>

#include <gtest/gtest.h>

#include "oxmv/values/Array.h"
#include "tests/support/Decoding.h"
#include "tests/support/Encoding.h"
#include "tests/support/Printing.h"
#include "tests/support/StreamBuilder.h"

namespace oxmv::test {
namespace {

using namespace std::string_view_literals;

constexpr Layout bothLayouts[] = {Layout::exact, Layout::readable};

Value dataOf(std::size_t size) { return Value::data(Bytes(size, 0xAB)); }

TEST(TagStreamEncoderNested, IsAHeaderAndTheStream) {
  for (const Layout layout : bothLayouts) {
    EXPECT_EQ(
        encoded(Dictionary{{"COL1", Dictionary{{"TAKE", 1}}}, {"COL2", Dictionary()}}, layout),
        (Bytes{'C', 'O', 'L', '1', 12, 0, 0, 0,                //
               'T', 'A', 'K', 'E', 4,  0, 0, 'B', 1, 0, 0, 0,  //
               'C', 'O', 'L', '2', 0,  0, 0, 0}));
  }
}

TEST(TagStreamEncoderNested, HasAnOrderOfItsOwn) {
  const Dictionary nested{{"COL1", Dictionary()}, {"TAKE", 1}, {"PRCS", 2}, {"DTFO", 3}};
  EXPECT_EQ(encoded(Dictionary{{"COL2", nested}}),
            (Bytes{'C', 'O', 'L', '2', 56, 0, 0, 0,                //
                   'P', 'R', 'C', 'S', 4,  0, 0, 'L', 2, 0, 0, 0,  //
                   'T', 'A', 'K', 'E', 4,  0, 0, 'B', 1, 0, 0, 0,  //
                   'C', 'O', 'L', '1', 0,  0, 0, 0,                //
                   'D', 'T', 'F', 'I', 4,  0, 0, 'L', 0, 0, 0, 0,  //
                   'D', 'T', 'F', 'O', 4,  0, 0, 'L', 3, 0, 0, 0}));
}

TEST(TagStreamEncoderNested, KeepsStreamsUnpadded) {
  const Dictionary tags{{"COL1", Dictionary{{"FREE", Value::data(Bytes{9, 8, 7})}}},
                        {"COL2", Dictionary{{"TAKE", 1}}}};
  EXPECT_EQ(encoded(tags), (Bytes{'C', 'O', 'L', '1', 11, 0, 0, 0,             //
                                  'F', 'R', 'E', 'E', 3,  0, 0, 'c', 9, 8, 7,  //
                                  'C', 'O', 'L', '2', 12, 0, 0, 0,             //
                                  'T', 'A', 'K', 'E', 4,  0, 0, 'B', 1, 0, 0, 0}));
}

TEST(TagStreamEncoderNested, ReadableStreamsAreWhole) {
  const Dictionary tags{{"COL1", Dictionary{{"FREE", Value::data(Bytes{9, 8, 7})}}},
                        {"COL2", Dictionary{{"TAKE", 1}}}};
  EXPECT_EQ(encoded(tags, Layout::readable),
            (Bytes{'C', 'O', 'L', '1', 12, 0, 0, 0,                //
                   'F', 'R', 'E', 'E', 3,  0, 0, 'c', 9, 8, 7, 0,  //
                   'C', 'O', 'L', '2', 12, 0, 0, 0,                //
                   'T', 'A', 'K', 'E', 4,  0, 0, 'B', 1, 0, 0, 0}));
}

// Display lists.

TEST(TagStreamEncoderNested, DisplayListIsARecordAnElement) {
  for (const Layout layout : bothLayouts) {
    EXPECT_EQ(
        encoded(Dictionary{{"DSPm", Array::of(Dictionary{{"TAKE", 1}}, Dictionary())}}, layout),
        (Bytes{'D', 'S', 'P', 'm', 12, 0, 0, 0,                //
               'T', 'A', 'K', 'E', 4,  0, 0, 'B', 1, 0, 0, 0,  //
               'D', 'S', 'P', 'm', 0,  0, 0, 0}));
  }
}

TEST(TagStreamEncoderNested, DisplayListIsPaddedInBothLayouts) {
  const Dictionary element{{"FREE", Value::data(Bytes{9, 8, 7})}};
  EXPECT_EQ(encoded(Dictionary{{"DSPm", Array::of(element)}, {"TAKE", 1}}),
            (Bytes{'D', 'S', 'P', 'm', 11, 0, 0, 0,                //
                   'F', 'R', 'E', 'E', 3,  0, 0, 'c', 9, 8, 7, 0,  // and the padding
                   'T', 'A', 'K', 'E', 4,  0, 0, 'B', 1, 0, 0, 0}));
  EXPECT_EQ(encoded(Dictionary{{"DSPm", Array::of(element)}}, Layout::readable),
            (Bytes{'D', 'S', 'P', 'm', 12, 0, 0, 0,  //
                   'F', 'R', 'E', 'E', 3,  0, 0, 'c', 9, 8, 7, 0}));
}

TEST(TagStreamEncoderNested, ElementThatIsNoDictionaryIsLeftOut) {
  EXPECT_EQ(encoded(Dictionary{{"DSPm", Array::of(1, "x", Dictionary(), Array())}}),
            (Bytes{'D', 'S', 'P', 'm', 0, 0, 0, 0}));
  EXPECT_EQ(encoded(Dictionary{{"CTLp", Array::of(1, "x", Dictionary(), Array())}}),
            (Bytes{'C', 'T', 'L', 'p', 8, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0,  //
                   0,   0,   0,   0,   0, 0, 0, 0}));
}

// Control points.

TEST(TagStreamEncoderNested, ControlPointIsTwoIntegersAndTheStream) {
  const Array points = Array::of(Dictionary{{"CTLPData", Array::of(10, -1)}, {"TAKE", 1}},
                                 Dictionary{{"CTLPData", Array::of(3.9f, "4")}});
  for (const Layout layout : bothLayouts) {
    EXPECT_EQ(encoded(Dictionary{{"CTLp", points}}, layout),
              (Bytes{'C', 'T', 'L', 'p', 20,   0,    0,    0,                 //
                     10,  0,   0,   0,   0xFF, 0xFF, 0xFF, 0xFF,              //
                     'T', 'A', 'K', 'E', 4,    0,    0,    'B',  1, 0, 0, 0,  //
                     'C', 'T', 'L', 'p', 8,    0,    0,    0,                 //
                     3,   0,   0,   0,   4,    0,    0,    0,                 //
                     0,   0,   0,   0,   0,    0,    0,    0}));
  }
}

TEST(TagStreamEncoderNested, KeepsTerminatorOfControlPointsAlsoOfNone) {
  for (const Layout layout : bothLayouts)
    EXPECT_EQ(encoded(Dictionary{{"CTLp", Array()}}, layout), Bytes(8, 0));
}

TEST(TagStreamEncoderNested, ControlPointWithoutExactlyTwoIntegersHasZeros) {
  const Bytes zeros = {'C', 'T', 'L', 'p', 8, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0,  //
                       0,   0,   0,   0,   0, 0, 0, 0};
  for (const Value& data : {Value(Array::of(7)), Value(Array::of(7, 8, 9)), Value(Array()),
                            Value(7), Value("7"), Value(Dictionary{{"a", 7}, {"b", 8}})}) {
    EXPECT_EQ(encoded(Dictionary{{"CTLp", Array::of(Dictionary{{"CTLPData", data}})}}), zeros)
        << testing::PrintToString(data);
  }
  EXPECT_EQ(encoded(Dictionary{{"CTLp", Array::of(Dictionary())}}), zeros);
  EXPECT_EQ(encoded(Dictionary{{"CTLp", Array::of(Dictionary{{"another name", Array::of(5, 6)}})}}),
            zeros);
  Dictionary removed{{"CTLPData", Array::of(5, 6)}};
  removed.remove("CTLPData");
  EXPECT_EQ(encoded(Dictionary{{"CTLp", Array::of(removed)}}), zeros);
}

TEST(TagStreamEncoderNested, KeepsControlPointsUnpadded) {
  const Dictionary element{{"FREE", Value::data(Bytes{9, 8, 7})}, {"CTLPData", Array::of(1, 2)}};
  EXPECT_EQ(encoded(Dictionary{{"CTLp", Array::of(element)}}),
            (Bytes{'C', 'T', 'L', 'p', 19, 0, 0, 0,             //
                   1,   0,   0,   0,   2,  0, 0, 0,             //
                   'F', 'R', 'E', 'E', 3,  0, 0, 'c', 9, 8, 7,  //
                   0,   0,   0,   0,   0,  0, 0, 0}));
}

// Sizes. A stream of one FREE record is 8 bytes longer than its data.

struct Nested {
  const char* tag;
  Value (*around)(const Dictionary&);
  std::size_t before;  // bytes between header and stream
};
const Nested everyNested[] = {
    {"COL1", [](const Dictionary& tags) { return Value(tags); }, 0},
    {"COL2", [](const Dictionary& tags) { return Value(tags); }, 0},
    {"DSPm", [](const Dictionary& tags) { return Value(Array::of(tags)); }, 0},
    {"CTLp", [](const Dictionary& tags) { return Value(Array::of(tags)); }, 8},
};

Bytes headerOf(const Bytes& stream) { return {stream.begin(), stream.begin() + 8}; }

Bytes header(const char* tag, std::uint32_t size) {
  return StreamBuilder().header(tag, size, 0).bytes();
}

TEST(TagStreamEncoderNested, KeepsTheLow16BitsOfItsSize) {
  for (const auto& [tag, around, before] : everyNested) {
    const auto encodedOf = [&, make = around, key = tag](std::size_t dataSize) {
      return encoded(Dictionary{{key, make(Dictionary{{"FREE", dataOf(dataSize)}})}});
    };
    const auto more = static_cast<std::uint32_t>(before);
    EXPECT_EQ(headerOf(encodedOf(0xFFFC - 8)), header(tag, 0xFFFC + more));
    EXPECT_EQ(headerOf(encodedOf(0x10000 - 8)), header(tag, 0 + more));
    EXPECT_EQ(headerOf(encodedOf(0x10004 - 8)), header(tag, 4 + more));
    // Only the size is cut, never the stream.
    const std::size_t terminator = before;
    EXPECT_EQ(encodedOf(0x10004 - 8).size(), 8 + before + 0x10004 + terminator);
  }
}

TEST(TagStreamEncoderNested, ReadableSizeHas24Bits) {
  for (const auto& [tag, around, before] : everyNested) {
    const Dictionary nested{{"FREE", dataOf(0x10004 - 8)}};
    EXPECT_EQ(headerOf(encoded(Dictionary{{tag, around(nested)}}, Layout::readable)),
              header(tag, 0x10004 + static_cast<std::uint32_t>(before)));
  }
}

TEST(TagStreamEncoderNested, IsReadableWhileReadersStepOverIt) {
  for (const auto& [tag, around, before] : everyNested) {
    const std::size_t largest = 0xFFFFF4 - before - 8;
    const auto encodedOf = [&, make = around, key = tag](std::size_t size) {
      return encoded(Dictionary{{key, make(Dictionary{{"FREE", dataOf(size)}})}}, Layout::readable);
    };
    EXPECT_EQ(headerOf(encodedOf(largest)), header(tag, 0xFFFFF4)) << tag;
    EXPECT_EQ(encodedOf(largest + 1), tag == "CTLp"sv ? Bytes(8, 0) : Bytes()) << tag;
  }
}

TEST(TagStreamEncoderNested, IsWrittenExactlyWhileItsSizeHas24Bits) {
  for (const auto& [tag, around, before] : everyNested) {
    // The low 16 bits of the stream's length, and the two integers of a control point.
    const auto written = static_cast<std::uint32_t>(((0xFFFFFF - before) & 0xFFFF) + before);
    const std::size_t largest = 0xFFFFFF - before - 8;
    const auto encodedOf = [&, make = around, key = tag](std::size_t size) {
      return encoded(Dictionary{{key, make(Dictionary{{"FREE", dataOf(size)}})}});
    };
    EXPECT_EQ(headerOf(encodedOf(largest)), header(tag, written)) << tag;
    EXPECT_EQ(encodedOf(largest + 1), tag == "CTLp"sv ? Bytes(8, 0) : Bytes()) << tag;
  }
}

// The encoder gathers records in pieces of some thousand bytes, and a stream's size is known only
// when its header may have left: it stands at every place at the end of such a piece, and across
// it.
TEST(TagStreamEncoderNested, HasItsSizeWhereverItsHeaderStands) {
  const Dictionary inner{{"KWRd", Array(std::vector<Value>(1000, Value("ABCDEFGH")))}};
  StreamBuilder keywords;
  for (int i = 0; i < 1000; ++i) keywords.record("KWRd", 'c', "ABCDEFGH"sv);
  for (std::size_t more = 0; more <= 512; ++more) {
    Dictionary tags;
    StreamBuilder expected;
    const auto fill = [&](const char* tag, std::size_t size) {
      tags.set(tag, dataOf(size));
      expected.header(tag, static_cast<std::uint32_t>(size), 'c').raw(Bytes(size, 0xAB));
    };
    for (const char* tag : {"FREE", "NOPP", "DPXI", "DPXM", "DPXO", "DPXT"}) fill(tag, 508);
    fill("DPXU", more);  // from 3104 to 3616 bytes
    tags.set("COL1", Dictionary{{"COL2", inner}, {"DSPm", Array::of(inner)}});
    expected.header("COL1", 2 * (8 + 16'000), 0);
    for (const char* tag : {"DSPm", "COL2"}) expected.header(tag, 16'000, 0).raw(keywords.bytes());
    ASSERT_TRUE(encoded(tags, Layout::exact) == expected.bytes()) << more;
  }
}

TEST(TagStreamEncoderNested, OneThatIsTooLargeLeavesTheOthers) {
  const Dictionary tooLarge{{"FREE", dataOf(0xFFFFFF)}};
  const Dictionary small{{"TAKE", 1}};
  EXPECT_EQ(encoded(Dictionary{{"DSPm", Array::of(small, tooLarge, small)}, {"COL1", tooLarge}}),
            encoded(Dictionary{{"DSPm", Array::of(small, small)}}));
}

// One dictionary in many places.

// Each level holds the one within it twice.
Dictionary doubled(int levels) {
  Dictionary tags;
  for (int level = 0; level < levels; ++level) {
    const Dictionary inner = tags;
    tags.set("COL1", inner);
    tags.set("COL2", inner);
  }
  return tags;
}

TEST(TagStreamEncoderNested, DoublesWithEveryLevelWhileThatFits) {
  EXPECT_EQ(encoded(doubled(2)), (Bytes{'C', 'O', 'L', '1', 16, 0, 0, 0,  //
                                        'C', 'O', 'L', '1', 0,  0, 0, 0,  //
                                        'C', 'O', 'L', '2', 0,  0, 0, 0,  //
                                        'C', 'O', 'L', '2', 16, 0, 0, 0,  //
                                        'C', 'O', 'L', '1', 0,  0, 0, 0,  //
                                        'C', 'O', 'L', '2', 0,  0, 0, 0}));
}

// The twenty-first from within would take 32 MB, and is left out half a million times: as if the
// twenty-second were empty.
TEST(TagStreamEncoderNested, OneThatIsTooLargeInManyPlacesIsTriedOnce) {
  const Bytes stream = encoded(doubled(40));
  EXPECT_EQ(stream.size(), 16u * ((1u << 18) - 1));
  EXPECT_TRUE(stream == encoded(doubled(18)));
  EXPECT_TRUE(encoded(doubled(34), Layout::readable) == encoded(doubled(12), Layout::readable));
}

// A list that holds the same dictionary a million times: no more of them are written than it takes
// to see that they are too many.
TEST(TagStreamEncoderNested, ListThatIsTooLargeIsNotWrittenToItsEnd) {
  const Dictionary element{{"FREE", dataOf(1'000'000)}};
  const Dictionary list{{"DSPm", Array(std::vector<Value>(1'000'000, Value(element)))}};
  EXPECT_EQ(encoded(Dictionary{{"COL1", list}, {"TAKE", 1}}),
            StreamBuilder().record("TAKE", 'B', 1).bytes());
}

// What is too large at one level need not be so a level deeper, where less of it is written.
TEST(TagStreamEncoderNested, OneThatIsTooLargeAtALevelIsTriedAtOthers) {
  const Value tenMegabytes = dataOf(10'000'000);
  Dictionary inner{{"FREE", tenMegabytes}};
  for (int level = 1; level < 62; ++level) inner = {{"COL1", inner}};
  const Dictionary tags{{"FREE", tenMegabytes}, {"COL1", inner}};
  EXPECT_EQ(encoded(Dictionary{{"COL1", tags}}), Bytes());
  const Bytes deeper = encoded(Dictionary{{"COL2", Dictionary{{"COL1", tags}}}});
  EXPECT_GT(deeper.size(), 10'000'000u);
  EXPECT_TRUE(encoded(Dictionary{{"COL1", tags}, {"COL2", Dictionary{{"COL1", tags}}}}) == deeper);
}

// What is too large behind the two integers of a control point need not be so without them.
TEST(TagStreamEncoderNested, OneThatIsTooLargeAsAControlPointIsTriedElsewhere) {
  const Dictionary large{{"FREE", dataOf(0xFFFFFC - 8)}};
  const Dictionary tags{{"COL1", Dictionary{{"CTLp", Array::of(large)}}},
                        {"COL2", Dictionary{{"COL1", large}, {"TAKE", 1}}}};
  // So the second is too large with it, and not written without it.
  EXPECT_EQ(encoded(tags), StreamBuilder().record("COL1", 0, Bytes(8, 0)).bytes());
}

// Depth: the outermost stream is level 0, and there are 64.

TEST(TagStreamEncoderNested, NestsSixtyFourLevelsAndNoMore) {
  for (const auto& [tag, around, before] : everyNested) {
    Value value = Dictionary{{"PRCS", 64}};
    for (int level = 63; level >= 0; --level)
      value = Dictionary{{tag, around(value.dictionary())}, {"PRCS", level}};
    // Below the last level nothing is written; for a control point that leaves the terminator.
    Bytes expected = StreamBuilder().record("PRCS", 'L', 63).bytes();
    if (tag == "CTLp"sv) expected.insert(expected.end(), 8, 0);
    for (int level = 62; level >= 0; --level) {
      StreamBuilder stream;
      stream.record("PRCS", 'L', level);
      stream.header(tag, static_cast<std::uint32_t>(before + expected.size()), 0);
      stream.raw(Bytes(before, 0)).raw(expected);
      expected = stream.bytes();
      if (tag == "CTLp"sv) expected.insert(expected.end(), 8, 0);
    }
    for (const Layout layout : bothLayouts)
      EXPECT_EQ(encoded(value.dictionary(), layout), expected) << tag;
  }
}

}  // namespace
}  // namespace oxmv::test
