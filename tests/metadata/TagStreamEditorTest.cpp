#include <cstdint>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "oxmv/metadata/TagStreamDecoder.h"
#include "oxmv/metadata/TagStreamEditor.h"
#include "oxmv/metadata/TagStreamFormat.h"
#include "oxmv/values/Array.h"
#include "tests/support/Printing.h"
#include "tests/support/StreamBuilder.h"

namespace oxmv {
namespace {

using test::Bytes;
using test::StreamBuilder;

// The code of a refusal and the offset, or "done".
std::string outcome(const std::optional<EditError>& error) {
  if (!error) return "done";
  EXPECT_FALSE(error->message.empty());
  return std::string(codeOf(error->refusal)) + " at " + std::to_string(error->offset);
}

Bytes set(const StreamBuilder& stream, std::string_view path, const Value& value,
          Layout layout = Layout::exact) {
  TagStreamEditor editor(stream.bytes(), layout);
  EXPECT_EQ(outcome(editor.set(path, value)), "done") << path;
  return editor.stream();
}

Bytes append(const StreamBuilder& stream, std::string_view path, const Value& element) {
  TagStreamEditor editor(stream.bytes());
  EXPECT_EQ(outcome(editor.append(path, element)), "done") << path;
  return editor.stream();
}

Bytes remove(const StreamBuilder& stream, std::string_view path) {
  TagStreamEditor editor(stream.bytes());
  EXPECT_EQ(outcome(editor.remove(path)), "done") << path;
  return editor.stream();
}

// That the edit is refused so, and leaves every byte.
void expectRefused(const StreamBuilder& stream, std::string_view path, const Value& value,
                   const std::string& expected) {
  TagStreamEditor editor(stream.bytes());
  EXPECT_EQ(outcome(editor.set(path, value)), expected) << path;
  EXPECT_EQ(editor.stream(), stream.bytes());
}

Value data(std::size_t size) { return Value::data(std::vector<std::uint8_t>(size, 0x5A)); }

// REEL "A1", an unknown tag, TAKE 3.
StreamBuilder ordinary() {
  return StreamBuilder().record("REEL", 'c', "A1").record("ZZZZ", 'q', "?!").record("TAKE", 'B', 3);
}

TEST(TagStreamEditor, ReplacesARecordInItsPlace) {
  EXPECT_EQ(set(ordinary(), "REEL", "A002"),
            StreamBuilder()
                .record("REEL", 'c', std::string_view("A002\0\0\0\0", 8))
                .record("ZZZZ", 'q', "?!")
                .record("TAKE", 'B', 3)
                .bytes());
  EXPECT_EQ(set(ordinary(), "TAKE", 4), StreamBuilder()
                                            .record("REEL", 'c', "A1")
                                            .record("ZZZZ", 'q', "?!")
                                            .record("TAKE", 'B', 4)
                                            .bytes());
}

TEST(TagStreamEditor, ReplacesTheRecordThatCounts) {
  const StreamBuilder twice =
      StreamBuilder().record("TAKE", 'B', 1).record("TAKE", 'B', 2).record("PRCS", 'L', 3);
  EXPECT_EQ(
      set(twice, "TAKE", 9),
      StreamBuilder().record("TAKE", 'B', 1).record("TAKE", 'B', 9).record("PRCS", 'L', 3).bytes());
}

TEST(TagStreamEditor, PassesOverARecordThatReadersIgnore) {
  const Bytes three(12);
  const Bytes four = {0, 0, 0x80, 0x3F, 0, 0, 0x80, 0x3F,
                      0, 0, 0x80, 0x3F, 0, 0, 0x80, 0x3F};  // 1.0f each
  const Value ones = Array::of(1.0f, 1.0f, 1.0f, 1.0f);
  EXPECT_EQ(
      set(StreamBuilder().record("WBAL", 'f', Bytes(16)).record("WBAL", 'f', three), "WBAL", ones),
      StreamBuilder().record("WBAL", 'f', four).record("WBAL", 'f', three).bytes());
  EXPECT_EQ(set(StreamBuilder().record("WBAL", 'f', three), "WBAL", ones),
            StreamBuilder().record("WBAL", 'f', four).bytes());
}

TEST(TagStreamEditor, PutsLeadingTagsFirst) {
  const StreamBuilder stream = StreamBuilder().record("TIMC", 'c', "1:00").record("TAKE", 'B', 3);
  EXPECT_EQ(set(stream, "PRCS", 1),
            StreamBuilder().record("PRCS", 'L', 1).raw(stream.bytes()).bytes());
  EXPECT_EQ(set(StreamBuilder().record("PRCS", 'L', 1).record("TAKE", 'B', 3), "TIMC", "2:00"),
            StreamBuilder()
                .record("PRCS", 'L', 1)
                .record("TIMC", 'c', "2:00")
                .record("TAKE", 'B', 3)
                .bytes());
  EXPECT_EQ(set(StreamBuilder().record("TAKE", 'B', 3), "UFRM", 1),
            StreamBuilder().record("UFRM", 'L', 1).record("TAKE", 'B', 3).bytes());
}

TEST(TagStreamEditor, PutsOtherTagsBeforeTheDeferredOnes) {
  const Bytes nested = StreamBuilder().record("TAKE", 'B', 1).bytes();
  const StreamBuilder stream =
      StreamBuilder().record("SHOT", 'B', 3).record("COL1", 0, nested).record("DTIN", 'L', 1);
  EXPECT_EQ(set(stream, "TAKE", 4), StreamBuilder()
                                        .record("SHOT", 'B', 3)
                                        .record("TAKE", 'B', 4)
                                        .record("COL1", 0, nested)
                                        .record("DTIN", 'L', 1)
                                        .bytes());
}

TEST(TagStreamEditor, PutsDeferredTagsInTheirOrder) {
  const Bytes nested = StreamBuilder().record("TAKE", 'B', 1).bytes();
  const Value one = Dictionary{{"TAKE", 1}};
  const StreamBuilder stream =
      StreamBuilder().record("COL1", 0, nested).record("DTFO", 'L', 2).record("TAKE", 'B', 3);
  EXPECT_EQ(set(stream, "COL2", one), StreamBuilder()
                                          .record("COL1", 0, nested)
                                          .record("DTFO", 'L', 2)
                                          .record("TAKE", 'B', 3)
                                          .record("COL2", 0, nested)
                                          .bytes());
  EXPECT_EQ(
      set(StreamBuilder().record("TAKE", 'B', 3).record("COL1", 0, nested).record("DTFO", 'L', 2),
          "COL2", one),
      StreamBuilder()
          .record("TAKE", 'B', 3)
          .record("COL1", 0, nested)
          .record("COL2", 0, nested)
          .record("DTFO", 'L', 2)
          .bytes());
}

TEST(TagStreamEditor, WritesOnlyTheOneOfAPairThatItIsAskedFor) {
  EXPECT_EQ(set(StreamBuilder().record("DTDR", 'L', 7), "DTIN", 5),
            StreamBuilder().record("DTIN", 'L', 5).record("DTDR", 'L', 7).bytes());
  EXPECT_EQ(set(StreamBuilder(), "DTFO", 5), StreamBuilder().record("DTFO", 'L', 5).bytes());
}

TEST(TagStreamEditor, FillsAnEmptyStream) {
  EXPECT_EQ(set(StreamBuilder(), "TAKE", 4), StreamBuilder().record("TAKE", 'B', 4).bytes());
}

TEST(TagStreamEditor, RemovesAllRecordsOfATag) {
  EXPECT_EQ(
      remove(StreamBuilder().record("TAKE", 'B', 1).record("PRCS", 'L', 3).record("TAKE", 'B', 2),
             "TAKE"),
      StreamBuilder().record("PRCS", 'L', 3).bytes());
  EXPECT_EQ(remove(ordinary(), "REEL"),
            StreamBuilder().record("ZZZZ", 'q', "?!").record("TAKE", 'B', 3).bytes());
}

TEST(TagStreamEditor, SaysThatThereIsNothingToRemove) {
  TagStreamEditor editor(ordinary().bytes());
  EXPECT_EQ(outcome(editor.remove("SHOT")), "absent at 0");
  EXPECT_EQ(outcome(editor.remove("COL1/TAKE")), "absent at 0");
  EXPECT_EQ(outcome(editor.remove("TAG /ISO")), "absent at 0");
  EXPECT_EQ(editor.stream(), ordinary().bytes());
}

TEST(TagStreamEditor, SetsAndExtendsLists) {
  const StreamBuilder stream = StreamBuilder()
                                   .record("KWRd", 'c', "one!")
                                   .record("TAKE", 'B', 1)
                                   .record("KWRd", 'c', "two!")
                                   .record("SHOT", 'B', 2);
  EXPECT_EQ(append(stream, "KWRd", "four"), StreamBuilder()
                                                .record("KWRd", 'c', "one!")
                                                .record("TAKE", 'B', 1)
                                                .record("KWRd", 'c', "two!")
                                                .record("KWRd", 'c', "four")
                                                .record("SHOT", 'B', 2)
                                                .bytes());
  EXPECT_EQ(set(stream, "KWRd", Array::of("four", "five")), StreamBuilder()
                                                                .record("KWRd", 'c', "four")
                                                                .record("KWRd", 'c', "five")
                                                                .record("TAKE", 'B', 1)
                                                                .record("SHOT", 'B', 2)
                                                                .bytes());
  EXPECT_EQ(remove(stream, "KWRd"),
            StreamBuilder().record("TAKE", 'B', 1).record("SHOT", 'B', 2).bytes());
  EXPECT_EQ(append(ordinary(), "SCPg", 5),
            StreamBuilder().raw(ordinary().bytes()).record("SCPg", 'H', 5).bytes());
}

TEST(TagStreamEditor, AppendsToListsOnly) {
  TagStreamEditor editor(ordinary().bytes());
  EXPECT_EQ(outcome(editor.append("REEL", "x")), "bad-path at 0");
  EXPECT_EQ(outcome(editor.append("WBAL", 1.0f)), "bad-path at 0");
  EXPECT_EQ(outcome(editor.append("TAG /ISO", 1)), "bad-path at 0");
}

TEST(TagStreamEditor, KeepsTheTerminatorBehindControlPoints) {
  const Bytes one = {1, 0, 0, 0, 2, 0, 0, 0};
  const Bytes two = {3, 0, 0, 0, 4, 0, 0, 0};
  const Value point = Dictionary{{"CTLPData", Array::of(3, 4)}};
  const StreamBuilder stream =
      StreamBuilder().record("TAKE", 'B', 1).record("CTLp", 0, one).raw(Bytes(8));
  EXPECT_EQ(append(stream, "CTLp", point), StreamBuilder()
                                               .record("TAKE", 'B', 1)
                                               .record("CTLp", 0, one)
                                               .record("CTLp", 0, two)
                                               .raw(Bytes(8))
                                               .bytes());
  EXPECT_EQ(append(StreamBuilder().record("TAKE", 'B', 1), "CTLp", point),
            StreamBuilder().record("TAKE", 'B', 1).record("CTLp", 0, two).raw(Bytes(8)).bytes());
  EXPECT_EQ(set(stream, "CTLp", Array::of(point)),
            StreamBuilder().record("TAKE", 'B', 1).record("CTLp", 0, two).raw(Bytes(8)).bytes());
  EXPECT_EQ(remove(stream, "CTLp"), StreamBuilder().record("TAKE", 'B', 1).bytes());
}

TEST(TagStreamEditor, TakesNoOtherRecordForTheTerminatorOfControlPoints) {
  const std::string_view zeros("\0\0\0\0", 4);
  const Bytes point = {1, 0, 0, 0, 2, 0, 0, 0};
  const StreamBuilder withPayload = StreamBuilder().record(zeros, 0, "kept");
  EXPECT_EQ(remove(StreamBuilder().record("CTLp", 0, point).raw(withPayload.bytes()), "CTLp"),
            withPayload.bytes());
  const StreamBuilder withType = StreamBuilder().header(zeros, 0, 'c').record("TAKE", 'B', 1);
  EXPECT_EQ(remove(StreamBuilder().record("CTLp", 0, point).raw(withType.bytes()), "CTLp"),
            withType.bytes());
}

TEST(TagStreamEditor, PutsInOneTerminatorAlsoWhereLostDataLookLikeMore) {
  // 65536 bytes of data, of whose size 16 bits are kept: the zeros stand behind the record.
  const Value points =
      Array::of(Dictionary{{"FREE", Value::data(std::vector<std::uint8_t>(65536))}});
  TagStreamEditor editor(ordinary().bytes(), Layout::exact);
  EXPECT_EQ(outcome(editor.set("CTLp", points, Fidelity::lossy)), "done");
  const Bytes kept = {0, 0, 0, 0, 0, 0, 0, 0, 'F', 'R', 'E', 'E', 0, 0, 0, 'c'};
  EXPECT_EQ(editor.stream(), ordinary().record("CTLp", 0, kept).raw(Bytes(8)).bytes());
}

// ISO 400 and Lens "35mm" in the group, with another tag between the records of the first.
StreamBuilder grouped() {
  return StreamBuilder()
      .record("TAGN", 'c', std::string_view("ISO\0", 4))
      .record("TAKE", 'B', 1)
      .record("TAGV", 'L', 400)
      .record("TAGN", 'c', std::string_view("Lens\0\0\0\0", 8))
      .record("TAGV", 'c', std::string_view("35mm\0\0\0\0", 8))
      .record("SHOT", 'B', 2);
}

TEST(TagStreamEditor, EditsEntriesOfAGroup) {
  EXPECT_EQ(set(grouped(), "TAG /ISO", 800),
            StreamBuilder()
                .record("TAGN", 'c', std::string_view("ISO\0", 4))
                .record("TAKE", 'B', 1)
                .record("TAGV", 'L', 800)
                .record("TAGN", 'c', std::string_view("Lens\0\0\0\0", 8))
                .record("TAGV", 'c', std::string_view("35mm\0\0\0\0", 8))
                .record("SHOT", 'B', 2)
                .bytes());
  EXPECT_EQ(set(grouped(), "TAG /a/b", 1), grouped()
                                               .dropLast(12)
                                               .record("TAGN", 'c', std::string_view("a/b\0", 4))
                                               .record("TAGV", 'L', 1)
                                               .record("SHOT", 'B', 2)
                                               .bytes());
  EXPECT_EQ(remove(grouped(), "TAG /ISO"),
            StreamBuilder()
                .record("TAKE", 'B', 1)
                .record("TAGN", 'c', std::string_view("Lens\0\0\0\0", 8))
                .record("TAGV", 'c', std::string_view("35mm\0\0\0\0", 8))
                .record("SHOT", 'B', 2)
                .bytes());
  expectRefused(grouped(), "TAG /" + std::string(256, 'n'), 1, "would-not-read-back at 0");
  EXPECT_EQ(remove(grouped(), "TAG "),
            StreamBuilder().record("TAKE", 'B', 1).record("SHOT", 'B', 2).bytes());
  EXPECT_EQ(set(StreamBuilder().record("SHOT", 'B', 2), "TAG /ISO", 5),
            StreamBuilder()
                .record("SHOT", 'B', 2)
                .record("TAGN", 'c', std::string_view("ISO\0", 4))
                .record("TAGV", 'L', 5)
                .bytes());
}

// Names in this group keep the NULs of their records: an entry is found by what people type, and a
// new one would gain some.
TEST(TagStreamEditor, KeepsThePaddedNamesOfTheRegGroup) {
  const StreamBuilder stream = StreamBuilder()
                                   .record("REGN", 'c', std::string_view("Model\0\0\0", 8))
                                   .record("REGV", 'L', 7);
  EXPECT_EQ(set(stream, "REG /Model", 8),
            StreamBuilder()
                .record("REGN", 'c', std::string_view("Model\0\0\0", 8))
                .record("REGV", 'L', 8)
                .bytes());
  EXPECT_EQ(set(stream, std::string("REG /Model\0\0\0", 13), 8), set(stream, "REG /Model", 8));
  EXPECT_EQ(remove(stream, "REG /Model"), Bytes());
  expectRefused(stream, "REG /Other", 1, "would-not-read-back at 0");
  expectRefused(stream, "REG /Model", "text", "not-stored at 0");
  TagStreamEditor editor(stream.bytes());
  EXPECT_EQ(outcome(editor.set("REG /Other", 1, Fidelity::lossy)), "done");
  EXPECT_EQ(editor.stream(), StreamBuilder()
                                 .raw(stream.bytes())
                                 .record("REGN", 'c', std::string_view("Other\0\0\0", 8))
                                 .record("REGV", 'L', 1)
                                 .bytes());
}

TEST(TagStreamEditor, EditsInsideNestedStreamsAndFixesTheirSizes) {
  const Bytes inner = StreamBuilder()
                          .record("TAKE", 'B', 1)
                          .record("REEL", 'c', std::string_view("A\0\0\0", 4))
                          .bytes();
  const StreamBuilder stream =
      StreamBuilder().record("SHOT", 'B', 2).record("COL1", 0, inner).record("DTIN", 'L', 3);
  const Bytes edited = StreamBuilder()
                           .record("TAKE", 'B', 1)
                           .record("REEL", 'c', std::string_view("A002\0\0\0\0", 8))
                           .bytes();
  EXPECT_EQ(set(stream, "COL1/REEL", "A002"), StreamBuilder()
                                                  .record("SHOT", 'B', 2)
                                                  .record("COL1", 0, edited)
                                                  .record("DTIN", 'L', 3)
                                                  .bytes());
  EXPECT_EQ(remove(stream, "COL1/REEL"),
            StreamBuilder()
                .record("SHOT", 'B', 2)
                .record("COL1", 0, StreamBuilder().record("TAKE", 'B', 1).bytes())
                .record("DTIN", 'L', 3)
                .bytes());
}

// A header alone is left, which readers take for no dictionary.
TEST(TagStreamEditor, RemovesTheLastTagOfANestedStream) {
  const StreamBuilder shot = StreamBuilder().record("SHOT", 'B', 2);
  const Bytes inner = StreamBuilder().record("TAKE", 'B', 1).bytes();
  EXPECT_EQ(remove(StreamBuilder(shot).record("COL1", 0, inner), "COL1/TAKE"),
            StreamBuilder(shot).header("COL1", 0, 0).bytes());
}

TEST(TagStreamEditor, RefusesANestedStreamLargerThanARecord) {
  const Bytes inner = StreamBuilder().record("FREE", 'c', Bytes(0xFFFFE0, 1)).bytes();
  const StreamBuilder stream = StreamBuilder().record("COL1", 0, inner);
  expectRefused(stream, "COL1/REEL", "sixteen letters.", "not-stored at 0");
  expectRefused(stream, "COL1/REEL", "seven..", "not-stored at 0");  // its length would wrap
  set(stream, "COL1/TAKE", 1);
  TagStreamEditor editor(stream.bytes());
  EXPECT_EQ(outcome(editor.set("COL1/FREE", data(4))), "done");
}

TEST(TagStreamEditor, EditsStreamsInStreams) {
  const auto nest = [](std::int32_t take) {
    const Bytes inner = StreamBuilder().record("TAKE", 'B', take).bytes();
    return StreamBuilder().record("COL2", 0, StreamBuilder().record("COL1", 0, inner).bytes());
  };
  EXPECT_EQ(set(nest(1), "COL2/COL1/TAKE", 5), nest(5).bytes());
  EXPECT_EQ(set(StreamBuilder(), "COL2/COL1/TAKE", 5), nest(5).bytes());
  expectRefused(nest(1), "COL2/COL1/WBAL", 5, "not-stored at 16");
  expectRefused(ordinary(), "COL2/WBAL", 5, "not-stored at 0");
}

TEST(TagStreamEditor, GoesAsDeepAsStreamsAreRead) {
  std::string path = "PRCS";
  Bytes expected = StreamBuilder().record("PRCS", 'L', 1).bytes();
  for (int i = 1; i < maxNesting; ++i) {
    path.insert(0, "COL1/");
    expected = StreamBuilder().record("COL1", 0, expected).bytes();
  }
  EXPECT_EQ(set(StreamBuilder(), path, 1), expected);
  EXPECT_EQ(set(StreamBuilder().raw(expected), path, 1), expected);
  expectRefused(StreamBuilder(), "COL1/" + path, 1, "too-deep at 0");
  expectRefused(StreamBuilder().raw(expected), "COL1/" + path, 1, "too-deep at 504");
}

TEST(TagStreamEditor, PadsWhatItWritesSoThatReadersFindWhatFollows) {
  Bytes five(5, 0x5A);
  EXPECT_EQ(
      set(StreamBuilder().record("FREE", 'c', Bytes(4)).record("TAKE", 'B', 1), "FREE", data(5)),
      StreamBuilder().record("FREE", 'c', five).record("TAKE", 'B', 1).bytes());
  // A last record without padding gets it when something is put behind it.
  EXPECT_EQ(set(StreamBuilder().record("FREE", 'c', five).dropLast(3), "TAKE", 1),
            StreamBuilder().record("FREE", 'c', five).record("TAKE", 'B', 1).bytes());
}

// A writer that does not pad leaves a record where readers see the padding of the one before.
TEST(TagStreamEditor, LeavesWhatStandsInThePaddingOfARecord) {
  const StreamBuilder unpadded = StreamBuilder()
                                     .record("FREE", 'c', Bytes(5, 0x5A))
                                     .dropLast(3)
                                     .record("REEL", 'c', "A001")
                                     .record("TAKE", 'B', 1);
  for (const Value& value : {data(4), data(8)})
    expectRefused(unpadded, "FREE", value, "damaged-stream at 13");
  expectRefused(unpadded, "SHOT", 1, "damaged-stream at 13");
  TagStreamEditor editor(unpadded.bytes());
  EXPECT_EQ(outcome(editor.remove("FREE")), "damaged-stream at 13");
  EXPECT_EQ(editor.stream(), unpadded.bytes());
  EXPECT_EQ(set(unpadded, "PRCS", 1),
            StreamBuilder().record("PRCS", 'L', 1).raw(unpadded.bytes()).bytes());
}

TEST(TagStreamEditor, RefusesToPutAMarkerFirst) {
  TagStreamEditor editor(
      StreamBuilder().record("REEL", 'c', "A001").marker(2).record("TAKE", 'B', 1).bytes());
  EXPECT_EQ(outcome(editor.remove("REEL")), "marker-first at 0");
}

// Of an unknown tag nobody misses a value: it is looked for where it stood.
TEST(TagStreamEditor, RefusesToMakeATagOfAMarker) {
  const auto expectNotRemoved = [](const StreamBuilder& stream, const std::string& expected) {
    TagStreamEditor editor(stream.bytes());
    EXPECT_EQ(outcome(editor.remove("WBAL")), expected);
    EXPECT_EQ(editor.stream(), stream.bytes());
  };
  const StreamBuilder balance = StreamBuilder().record("WBAL", 'f', Bytes(16));
  const Bytes unknown = StreamBuilder().record("NEWT", 'L', 7).bytes();
  // As the first tag it would take the unknown one for its payload.
  expectNotRemoved(StreamBuilder().raw(balance.bytes()).marker(0).raw(unknown),
                   "marker-first at 0");
  // Nobody looks for a second marker behind another.
  expectNotRemoved(
      StreamBuilder().record("TAKE", 'B', 1).marker(0).raw(balance.bytes()).marker(0).raw(unknown),
      "damaged-stream at 16");
  // The same within a stream.
  const Bytes inner = StreamBuilder().raw(balance.bytes()).marker(0).raw(unknown).bytes();
  TagStreamEditor editor(StreamBuilder().record("COL1", 0, inner).bytes());
  EXPECT_EQ(outcome(editor.remove("COL1/WBAL")), "marker-first at 8");
}

TEST(TagStreamEditor, LeavesMarkersWhereTheyAre) {
  const StreamBuilder stream = StreamBuilder()
                                   .record("PRCS", 'L', 1)
                                   .marker(3)
                                   .record("TIMB", 'B', 25)
                                   .record("TAKE", 'B', 2);
  EXPECT_EQ(set(stream, "TIMB", 30), StreamBuilder()
                                         .record("PRCS", 'L', 1)
                                         .marker(3)
                                         .record("TIMB", 'B', 30)
                                         .record("TAKE", 'B', 2)
                                         .bytes());
  EXPECT_EQ(set(stream, "SHOT", 9),
            StreamBuilder().raw(stream.bytes()).record("SHOT", 'B', 9).bytes());
  EXPECT_EQ(set(stream, "UFRM", 9), StreamBuilder()
                                        .record("PRCS", 'L', 1)
                                        .record("UFRM", 'L', 9)
                                        .marker(3)
                                        .record("TIMB", 'B', 25)
                                        .record("TAKE", 'B', 2)
                                        .bytes());
}

TEST(TagStreamEditor, LeavesWhatTrailsBehindTheLastRecord) {
  const StreamBuilder stream =
      StreamBuilder().record("TAKE", 'B', 1).header("NAME", 20, 'c').raw(Bytes(9, 'x'));
  EXPECT_EQ(
      set(stream, "TAKE", 2),
      StreamBuilder().record("TAKE", 'B', 2).header("NAME", 20, 'c').raw(Bytes(9, 'x')).bytes());
  EXPECT_EQ(set(stream, "SHOT", 2), StreamBuilder()
                                        .record("TAKE", 'B', 1)
                                        .record("SHOT", 'B', 2)
                                        .header("NAME", 20, 'c')
                                        .raw(Bytes(9, 'x'))
                                        .bytes());
}

TEST(TagStreamEditor, RefusesWhatReadersWouldNotReach) {
  // The first record claims more than there is: whatever is put behind it is never read.
  expectRefused(StreamBuilder().header("REEL", 9000, 'c').raw(Bytes(8, 'x')), "TAKE", 1,
                "damaged-stream at 16");
  // Its length wraps to 0, and the walk ends with it.
  expectRefused(StreamBuilder().header("TAKE", 0xFFFFF5, 'B').raw({1, 0, 0, 0}), "SHOT", 1,
                "damaged-stream at 8");
}

TEST(TagStreamEditor, RemovesAnEntryAndLeavesStrayValues) {
  const StreamBuilder stream = StreamBuilder()
                                   .record("TAGV", 'L', 1)
                                   .record("TAGN", 'c', std::string_view("a\0\0\0", 4))
                                   .record("TAGV", 'L', 2)
                                   .record("TAGV", 'L', 3);
  EXPECT_EQ(remove(stream, "TAG /a"),
            StreamBuilder().record("TAGV", 'L', 1).record("TAGV", 'L', 3).bytes());
}

TEST(TagStreamEditor, RefusesToMakeAMarkerOfATag) {
  // As the first bytes of the stream BF FE begin a tag; behind another record they would be a
  // marker.
  const StreamBuilder stream =
      StreamBuilder().raw({0xBF, 0xFE, 0, 2, 4, 0, 0, 'L', 1, 0, 0, 0}).record("TAKE", 'B', 1);
  expectRefused(stream, "PRCS", 1, "damaged-stream at 0");
  expectRefused(StreamBuilder().raw({0xBF, 0xFE, 0, 0, 4, 0, 0, 'L', 1, 0, 0, 0}), "TAKE", 1,
                "damaged-stream at 0");
}

TEST(TagStreamEditor, RefusesToPutARecordIntoAPayload) {
  // The first record lacks 12 bytes, as many as the first one that is put in; which, a name whose
  // value is lost, would not be missed.
  const StreamBuilder stream = StreamBuilder().header("CTFO", 16, 'c').raw({1, 2, 3, 4});
  TagStreamEditor editor(stream.bytes());
  const Value group = Dictionary{{"a", "text"}, {"b", 1}};
  EXPECT_EQ(outcome(editor.set("REG ", group, Fidelity::lossy)), "damaged-stream at 12");
  EXPECT_EQ(editor.stream(), stream.bytes());
}

TEST(TagStreamEditor, RefusesToHideAnUnknownRecord) {
  // Read as the first one only, for its payload is not all there.
  expectRefused(StreamBuilder().header("NEWT", 9000, 'c').raw(Bytes(8, 'x')), "TAKE", 1,
                "damaged-stream at 0");
}

TEST(TagStreamEditor, RefusesValuesThatWouldNotBeStored) {
  expectRefused(ordinary(), "REEL", "", "not-stored at 0");
  expectRefused(ordinary(), "REEL", 5, "not-stored at 0");
  expectRefused(ordinary(), "WBAL", Array::of(1.0f), "not-stored at 0");
  expectRefused(ordinary(), "GHTL", 1, "not-stored at 0");
  expectRefused(ordinary(), "MKGD", 1, "not-stored at 0");
  expectRefused(ordinary(), "COL1", Dictionary(), "not-stored at 0");
  expectRefused(ordinary(), "KWRd", Array(), "not-stored at 0");
  expectRefused(ordinary(), "REEL", Value(), "not-stored at 0");
}

TEST(TagStreamEditor, RefusesValuesThatWouldComeBackChangedUnlessToldOtherwise) {
  expectRefused(ordinary(), "GAIN", 70000, "would-not-read-back at 0");
  expectRefused(ordinary(), "KWRd", Array::of("one"), "would-not-read-back at 0");
  expectRefused(ordinary(), "REEL", "Caf\xC3\xA9", "would-not-read-back at 0");
  TagStreamEditor editor(ordinary().bytes());
  EXPECT_EQ(outcome(editor.set("GAIN", 70000, Fidelity::lossy)), "done");
  EXPECT_EQ(editor.stream(),
            StreamBuilder().raw(ordinary().bytes()).record("GAIN", 'B', 4464).bytes());
}

// The exact layout keeps 16 bits of a size: of more bytes readers take the rest for records.
std::vector<std::uint8_t> beginningWith(const StreamBuilder& records, std::size_t size) {
  std::vector<std::uint8_t> bytes = records.bytes();
  bytes.resize(size);
  return bytes;
}

TEST(TagStreamEditor, RefusesDataThatWouldComeBackInPieces) {
  const Value fragments =
      Value::data(beginningWith(StreamBuilder().record("FREE", 'c', Bytes{7, 0, 0, 0}), 65536));
  TagStreamEditor editor(ordinary().bytes(), Layout::exact);
  EXPECT_EQ(outcome(editor.set("FREE", fragments)), "would-not-read-back at 0");
  EXPECT_EQ(outcome(editor.set("FREE", fragments, Fidelity::lossy)), "would-not-read-back at 0");
  EXPECT_EQ(editor.stream(), ordinary().bytes());
  const Value others = Value::data(beginningWith(StreamBuilder().record("TAKE", 'B', 9), 65536));
  EXPECT_EQ(outcome(editor.set("FREE", others, Fidelity::lossy)), "done");
  EXPECT_EQ(editor.stream(),
            StreamBuilder().raw(ordinary().bytes()).record("FREE", 'c', Bytes()).bytes());
}

TEST(TagStreamEditor, RefusesAnElementThatWouldComeBackAsTwo) {
  // 16 bits of its size keep 8 bytes; in the zeros behind them readers go on until they find
  // another.
  const Value element = Dictionary{{"FREE", Value::data(std::vector<std::uint8_t>(65528))},
                                   {"DSPm", Array::of(Dictionary())}};
  TagStreamEditor exact(ordinary().bytes(), Layout::exact);
  EXPECT_EQ(outcome(exact.append("DSPm", element, Fidelity::lossy)), "would-not-read-back at 0");
  EXPECT_EQ(exact.stream(), ordinary().bytes());
  TagStreamEditor readable(ordinary().bytes(), Layout::readable);
  EXPECT_EQ(outcome(readable.append("DSPm", element, Fidelity::lossy)), "done");
}

TEST(TagStreamEditor, RefusesPathsThatNameNothing) {
  for (const char* path :
       {"", "REE", "REELS", "ZZZZ", "REEL/TAKE", "COL1/", "COL1/ZZZZ", "COL1REEL", "DSPm/TAKE"}) {
    expectRefused(ordinary(), path, 1, "bad-path at 0");
  }
}

TEST(TagStreamEditor, TakesTooFewBytesForNoStream) {
  // Eight bytes are no stream to those who load it; beside another record they would become one.
  expectRefused(StreamBuilder().header("KWRd", 0, 'c'), "TAKE", 1, "damaged-stream at 0");
  // And removing may not leave so few.
  TagStreamEditor editor(StreamBuilder().header("KWRd", 0, 'c').record("TAKE", 'B', 1).bytes());
  EXPECT_EQ(outcome(editor.remove("TAKE")), "too-short at 8");
}

TEST(TagStreamEditor, UsesTheLayoutItIsGiven) {
  TagStreamEditor exact(ordinary().bytes());
  EXPECT_EQ(outcome(exact.set("FREE", data(65540))), "would-not-read-back at 0");
  TagStreamEditor readable(ordinary().bytes(), Layout::readable);
  EXPECT_EQ(outcome(readable.set("FREE", data(65540))), "done");
}

TEST(TagStreamEditor, AnswersForEveryPrefixOfAStream) {
  const Bytes whole = grouped().record("COL1", 0, ordinary().bytes()).bytes();
  for (std::size_t size = 0; size <= whole.size(); ++size) {
    const Bytes prefix(whole.begin(), whole.begin() + static_cast<std::ptrdiff_t>(size));
    for (const char* path : {"TAKE", "PRCS", "COL1/TAKE", "TAG /ISO", "CTLp", "COL2/REEL"}) {
      TagStreamEditor editor(prefix);
      const bool isDone = !editor.set(path, 7) || !editor.remove(path);
      if (!isDone) {
        EXPECT_EQ(editor.stream(), prefix) << size << ' ' << path;
      }
    }
  }
}

}  // namespace
}  // namespace oxmv
