#include <cstdint>
#include <string>

#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include "tests/cli/CommandRunner.h"
#include "tests/support/StreamBuilder.h"
#include "tests/support/TempDir.h"

namespace oxmv::cli::test {
namespace {

using Json = nlohmann::ordered_json;
using oxmv::test::Bytes;
using oxmv::test::StreamBuilder;
using oxmv::test::TempDir;

const std::string data = OXMV_TEST_DATA "/streams/";

// The findings in a stream, without the name in front.
std::string findingsIn(const StreamBuilder& stream) {
  const std::string input(stream.bytes().begin(), stream.bytes().end());
  const Outcome outcome = run({"check", "-"}, input);
  EXPECT_EQ(outcome.exitCode, outcome.out.empty() ? 0 : 1);
  EXPECT_EQ(outcome.err, "");
  std::string findings;
  for (const std::string& line : linesOf(outcome.out)) {
    EXPECT_TRUE(line.starts_with("standard input: ")) << line;
    findings += line.substr(16) + '\n';
  }
  return findings;
}

StreamBuilder take() { return StreamBuilder().record("TAKE", 'B', 1); }

TEST(Check, SaysNothingWhenAllIsWell) {
  const Outcome outcome = run({"check", data + "typical-clip.colr", data + "eye-left.col1"});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_EQ(outcome.out, "");
  EXPECT_EQ(outcome.err, "");
}

TEST(Check, NamesFileByteAndCode) {
  const std::string file = data + "truncated-second-record.bin";
  const Outcome outcome = run({"check", file, data + "eye-left.col1"});
  EXPECT_EQ(outcome.exitCode, 1);
  EXPECT_EQ(outcome.out, file +
                             ": stopped at byte 12: record NAME claims 20 bytes, 16 are left"
                             " (truncated-record)\n");
}

TEST(Check, FindsWhatReadersIgnore) {
  EXPECT_EQ(findingsIn(take().record("ABCD", 'c', "")),
            "byte 12: ABCD: ignored, no such tag (unknown-tag)\n");
  EXPECT_EQ(findingsIn(take().record("WBAL", 'f', Bytes(12))),
            "byte 12: WBAL size 12: ignored, needs 16 (wrong-size)\n");
  EXPECT_EQ(findingsIn(take().record("COL1", '\0', "")),
            "byte 12: COL1: ignored, its nested stream is empty (empty-nested)\n");
  EXPECT_EQ(findingsIn(take().record("REGV", 'L', 1)),
            "byte 12: REGV: ignored, no name stands before it (value-without-name)\n");
  EXPECT_EQ(findingsIn(take().record("TAGN", 'c', "a")),
            "byte 12: TAGN: ignored, no value follows it (name-without-value)\n");
  EXPECT_EQ(findingsIn(take().header("TIMB", 0, 'B')),
            "byte 12: TIMB: ignored, too few bytes left for its number (short-payload)\n");
}

TEST(Check, FindsNumbersWhoseSizeIsNotTheirs) {
  // Read from the record behind them, or leaving bytes that nobody reads.
  const auto found = [](const char* tag, std::uint32_t size, char type) {
    return findingsIn(
        StreamBuilder().header(tag, size, type).raw(Bytes((size + 3) / 4 * 4)).raw(take().bytes()));
  };
  EXPECT_EQ(found("GAIN", 0, 'B'), "byte 0: GAIN size 0: read as if it were 4 (odd-size)\n");
  EXPECT_EQ(found("TIMB", 1, 'B'), "byte 0: TIMB size 1: read as if it were 4 (odd-size)\n");
  EXPECT_EQ(found("PRCS", 8, 'L'), "byte 0: PRCS size 8: read as if it were 4 (odd-size)\n");
  EXPECT_EQ(found("SATU", 2, 'f'), "byte 0: SATU size 2: read as if it were 4 (odd-size)\n");
  EXPECT_EQ(found("SCPg", 0, 'H'), "byte 0: SCPg size 0: read as if it were 4 (odd-size)\n");
  EXPECT_EQ(found("BADP", 6, 'H'), "byte 0: BADP size 6: read as if it were 4 (odd-size)\n");
  EXPECT_EQ(found("GUID", 4, 'G'), "byte 0: GUID size 4: read as if it were 16 (odd-size)\n");
  EXPECT_EQ(found("CTLp", 4, 0), "byte 0: CTLp size 4: read as if it were 8 (odd-size)\n");
  for (const char* tag : {"GAIN", "TIMB", "PRCS", "SATU", "SCPg", "BADP"})
    EXPECT_EQ(found(tag, 4, 'L'), "");
  EXPECT_EQ(found("GUID", 16, 'G'), "");
}

TEST(Check, FindsWhereReadersStop) {
  EXPECT_EQ(findingsIn(take().raw({0, 0, 0, 0})),
            "stopped at byte 12: 4 bytes are left, a record needs 8 (cut-header)\n");
  EXPECT_EQ(findingsIn(take().raw({0xBF, 0xFE, 0})),
            "stopped at byte 12: 3 bytes are left, a marker needs 4 (cut-marker)\n");
  EXPECT_EQ(findingsIn(StreamBuilder().header("FREE", 100, 'c').raw(Bytes(4))),
            "stopped at byte 0: record FREE claims 100 bytes, 4 are left (incomplete-record)\n");
  EXPECT_EQ(findingsIn(StreamBuilder().header("TAKE", 0xFFFFF5, 'c').raw(Bytes(4))),
            "byte 0: TAKE claims 16777205 bytes, 4 are there (incomplete-record)\n"
            "stopped at byte 0: record TAKE of size 16777205 leads back to itself (length-zero)\n");
}

TEST(Check, FindsStreamsThatAreNestedTooDeep) {
  StreamBuilder stream = take();
  for (int i = 0; i < 64; ++i) stream = StreamBuilder().record("COL1", '\0', stream.bytes());
  EXPECT_EQ(findingsIn(stream),
            "byte 504: COL1: ignored, more than 64 streams within one another (too-deep)\n");
}

TEST(Check, FindsPayloadsThatAreCut) {
  EXPECT_EQ(findingsIn(StreamBuilder().header("TAKE", 100, 'B').raw({1, 0, 0, 0})),
            "byte 0: TAKE claims 100 bytes, 4 are there (incomplete-record)\n");
}

TEST(Check, FindsValuesThatAreReplaced) {
  EXPECT_EQ(findingsIn(take().record("TAKE", 'B', 2)),
            "byte 0: TAKE: its value is replaced at byte 12 (replaced-value)\n");
  // The second one is of no size that is read, so the first one stays.
  EXPECT_EQ(findingsIn(take().record("WBAL", 'f', Bytes(16)).record("WBAL", 'f', Bytes(12))),
            "byte 36: WBAL size 12: ignored, needs 16 (wrong-size)\n");
}

TEST(Check, FindsText) {
  EXPECT_EQ(findingsIn(take().record("REEL", 'c', "Caf\xE9")),
            "byte 12: REEL: its text has no NUL at its end (text-without-nul)\n"
            "byte 12: REEL: not UTF-8, read as ISO-8859-1 (text-not-utf8)\n");
  // The NUL may stand in the padding.
  EXPECT_EQ(findingsIn(take().record("REEL", 'c', "Caf\xC3\xA9")), "");
  // Writers leave no room for a NUL in these.
  EXPECT_EQ(findingsIn(take().record("TIMC", 'c', "01:02:03")), "");
  EXPECT_EQ(findingsIn(take().record("DTAG", 'F', "ABCD")), "");
  EXPECT_EQ(findingsIn(take().record("KWRd", 'c', "four")), "");
}

TEST(Check, FindsPadding) {
  EXPECT_EQ(findingsIn(take().header("REEL", 2, 'c').raw({'a', 0, 0, 9})),
            "byte 12: REEL: its padding is not zero (padding-not-zero)\n");
  EXPECT_EQ(findingsIn(take().header("FREE", 5, 'c').raw(Bytes(5))),
            "byte 12: FREE: 3 bytes of padding are missing behind it (padding-missing)\n");
}

TEST(Check, FindsZerosOnce) {
  EXPECT_EQ(findingsIn(take().raw(Bytes(800))),
            "byte 12: 800 bytes of zeros: ignored (unknown-tag)\n");
}

TEST(Check, FindsNothingInTheEndOfControlPoints) {
  const Bytes point = StreamBuilder().raw(Bytes(8)).record("SATU", 'f', 1.0f).bytes();
  EXPECT_EQ(findingsIn(take().record("CTLp", '\0', point).raw(Bytes(8))), "");
  EXPECT_EQ(findingsIn(take().raw(Bytes(8))), "");  // a list of none
  EXPECT_EQ(findingsIn(StreamBuilder().raw(Bytes(8)).record("TAKE", 'B', 1)),
            "byte 0: 8 bytes of zeros: ignored (unknown-tag)\n");
}

TEST(Check, FindsFilesThatAreTooShort) {
  EXPECT_EQ(findingsIn(take().dropLast(1)),
            "byte 0: 11 bytes are too few: a clip with tags has 12 or more (too-short)\n");
  EXPECT_EQ(findingsIn(StreamBuilder()),
            "byte 0: 0 bytes are too few: a clip with tags has 12 or more (too-short)\n");
}

TEST(Check, FindsWhatIsOddInNestedStreams) {
  EXPECT_EQ(findingsIn(take().record("COL1", '\0', take().record("ABCD", 'c', "").bytes())),
            "byte 32: ABCD: ignored, no such tag (unknown-tag)\n");
}

TEST(Check, ListsInTheOrderOfTheFile) {
  EXPECT_EQ(findingsIn(StreamBuilder()
                           .record("TAGN", 'c', "a")
                           .record("ABCD", 'c', "")
                           .record("TAGN", 'c', "b")),
            "byte 0: TAGN: ignored, no value follows it (name-without-value)\n"
            "byte 12: ABCD: ignored, no such tag (unknown-tag)\n"
            "byte 20: TAGN: ignored, no value follows it (name-without-value)\n");
}

TEST(Check, NotesWhatItFoundWhenVerbose) {
  const std::string file = data + "eye-left.col1";
  EXPECT_EQ(run({"check", "-v", file}).err, "oxmv: note: " + file + ": 0 findings\n");
}

TEST(Check, GivesJson) {
  const std::string file = data + "unknown-tag-between.bin";
  const Outcome outcome = run({"check", "--json", file, "missing"});
  EXPECT_EQ(outcome.exitCode, 3);
  EXPECT_EQ(outcome.out,
            "[\n{\"schema\":\"oxmv.check/1\",\"file\":\"" + file +
                "\",\"findings\":[{\"code\":\"unknown-tag\",\"offset\":12,\"tag\":\"ZZZZ\","
                "\"message\":\"ZZZZ: ignored, no such tag\"}],\"error\":null},\n"
                "{\"schema\":\"oxmv.check/1\",\"file\":\"missing\",\"findings\":null,"
                "\"error\":{\"code\":\"missing\",\"message\":\"No such file or directory\"}}\n]\n");
  EXPECT_EQ(linesOf(run({"check", "--ndjson", file, file}).out).size(), 2u);
  EXPECT_EQ(run({"check", "--json", file}).exitCode, 1);
  const Json tooShort = Json::parse(run({"check", "--json", "-"}, "").out);
  EXPECT_TRUE(tooShort[0]["findings"][0]["tag"].is_null());
  EXPECT_EQ(tooShort[0]["file"], "-");
}

TEST(Check, ReadsNamesFromStandardInput) {
  const Outcome outcome = run({"check", "--files-from", "-"}, data + "eye-left.col1\nmissing\n");
  EXPECT_EQ(outcome.exitCode, 3);
  EXPECT_EQ(outcome.err, "oxmv: error: missing: No such file or directory (missing)\n");
}

TEST(Check, TheHigherExitCodeWins) {
  EXPECT_EQ(run({"check", data + "unknown-tag-between.bin", "missing"}).exitCode, 3);
  EXPECT_EQ(run({"check", "missing", data + "unknown-tag-between.bin"}).exitCode, 3);
}

}  // namespace
}  // namespace oxmv::cli::test
