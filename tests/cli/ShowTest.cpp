#include <span>
#include <string>

#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include "tests/cli/CommandRunner.h"
#include "tests/support/SampleJson.h"
#include "tests/support/StreamBuilder.h"
#include "tests/support/TempDir.h"
#include "tests/support/TestData.h"
#include "tests/support/WideLong.h"

namespace oxmv::cli::test {
namespace {

using Json = nlohmann::ordered_json;
using oxmv::test::StreamBuilder;
using oxmv::test::TempDir;

const std::string data = OXMV_TEST_DATA "/streams/";

Dictionary dictionaryOf(const Json& tags) {
  const std::string text = tags.dump();
  return oxmv::test::dictionaryFromJson(oxmv::test::bytesOf(text));
}

std::vector<std::string> keysOf(const Dictionary& dictionary) {
  std::vector<std::string> keys;
  for (const auto& entry : dictionary) keys.emplace_back(entry.key);
  return keys;
}

// The table of one clip with this stream.
std::string tableOf(const StreamBuilder& stream, const std::vector<std::string>& flags = {}) {
  const TempDir folder;
  writeFile(folder / "clip.colr", stream.bytes());
  std::vector<std::string> arguments = {"show", folder / "clip.colr"};
  arguments.insert(arguments.end(), flags.begin(), flags.end());
  return run(arguments).out;
}

TEST(Show, ShowsTagsWithLabelsAndValues) {
  const Outcome outcome = run({"show", data + "eye-left.col1"});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_EQ(outcome.out,
            "TIMC  Timecode   01:02:03:04\n"
            "REEL  Reel name  A001_C003L\n"
            "HOFF             0.01\n");
  EXPECT_EQ(outcome.err, "");
}

TEST(Show, IndentsWhatIsNested) {
  EXPECT_EQ(run({"show", data + "nested-col1-col2.bin", "-q"}).out,
            "COL1                  1 tag\n"
            "  SATU    Saturation  0.5\n"
            "COL2                  1 tag\n"
            "  COL1                1 tag\n"
            "    EXPS              2.0\n");
  EXPECT_EQ(run({"show", data + "tag-group-iso-400.bin"}).out,
            "TAG     2 entries\n"
            "  ISO   400\n"
            "  Lens  35mm\n");
  EXPECT_EQ(run({"show", data + "control-points.bin"}).out,
            "CTLp                      2 elements\n"
            "  [0]                     2 tags\n"
            "    SATU      Saturation  0.5\n"
            "    CTLPData              10 20\n"
            "  [1]                     1 tag\n"
            "    CTLPData              -1 2\n");
}

TEST(Show, CountsTheNulsAtTheEndOfTexts) {
  EXPECT_EQ(run({"show", data + "three-keywords.bin"}).out,
            "KWRd   3 elements\n"
            "  [0]  one (+1 NUL)\n"
            "  [1]  two!\n"
            "  [2]  three (+3 NUL)\n");
  EXPECT_EQ(run({"show", data + "reg-group-keeps-padding.bin"}).out,
            "REG               2 entries\n"
            "  Model (+3 NUL)  7\n"
            "  Text            abc (+1 NUL)\n");
}

TEST(Show, ShowsNumbersThatAreNotFinite) {
  EXPECT_EQ(run({"show", data + "not-finite-floats.bin"}).out,
            "SATU  Saturation  nan\n"
            "ZOOM              -inf\n"
            "EXPS              1e-45\n");
}

// Of clip-guid.bin: where the fields stand depends on how long a long is.
const std::string clipGuid = oxmv::test::is64Bit ? "11223344-5566-7788-1011-12135245454C"
                                                 : "11223344-BBCC-99AA-6655-887710111213";

TEST(Show, ShowsTheGuidOfTheClip) {
  const Outcome outcome = run({"show", data + "clip-guid.bin"});
  EXPECT_EQ(linesOf(outcome.out).front(), "clip GUID " + clipGuid);
}

TEST(Show, SaysThatThereAreNoTags) {
  const Outcome outcome = run({"show", "-"}, "");
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_EQ(outcome.out, "no tags\n");
  EXPECT_EQ(outcome.err, "");
}

TEST(Show, HidesControlCharactersAndThoseThatTurnTextAround) {
  EXPECT_EQ(tableOf(StreamBuilder().record("REEL", 'c', "a\x1B[31m\nb\x7F\xE2\x80\xAE\xC2\x85")),
            "REEL  Reel name  a\\x1B[31m\\x0Ab\\x7F\\u{202E}\\u{0085}\n");
  EXPECT_EQ(tableOf(StreamBuilder().record("TAGN", 'c', "na\tme").record("TAGV", 'L', 1)),
            "TAG         1 entry\n"
            "  na\\x09me  1\n");
}

TEST(Show, CutsLongValuesUnlessVerbose) {
  StreamBuilder stream;
  oxmv::test::Bytes numbers;
  for (std::uint8_t i = 0; i < 20; ++i) numbers.insert(numbers.end(), {i, 0, 0, 0});
  stream.record("BADP", 'H', numbers);
  stream.record("FREE", 'c', oxmv::test::Bytes(20, 0xAB));
  stream.record("DSCR", 'c', std::string(300, 'x'));
  for (int i = 0; i < 18; ++i) stream.record("CMId", 'c', "abcd");
  const auto cut = linesOf(tableOf(stream));
  EXPECT_EQ(cut[0], "BADP    0 1 2 3 4 5 6 7 8 9 10 11 12 13 14 15 ... (20 numbers)");
  EXPECT_EQ(cut[1], "FREE    abababababababababababababababab... (20 bytes)");
  EXPECT_EQ(cut[2], "DSCR    " + std::string(256, 'x') + "... (300 bytes)");
  EXPECT_EQ(cut[3], "CMId    18 elements");
  EXPECT_EQ(cut.back(), "  ...   2 more");
  const auto whole = linesOf(tableOf(stream, {"--verbose"}));
  EXPECT_EQ(whole[0], "BADP    0 1 2 3 4 5 6 7 8 9 10 11 12 13 14 15 16 17 18 19");
  EXPECT_EQ(whole[2], "DSCR    " + std::string(300, 'x'));
  EXPECT_EQ(whole.back(), "  [17]  abcd");
}

TEST(Show, NamesTheFilesWhereThereAreSeveral) {
  const Outcome outcome = run({"show", data + "eye-left.col1", data + "eye-right.col2"});
  const auto lines = linesOf(outcome.out);
  ASSERT_EQ(lines.size(), 9u);
  EXPECT_EQ(lines[0], data + "eye-left.col1");
  EXPECT_EQ(lines[4], "");
  EXPECT_EQ(lines[5], data + "eye-right.col2");
}

TEST(Show, WarnsOfWhatIsIgnored) {
  const std::string file = data + "truncated-second-record.bin";
  const Outcome outcome = run({"show", file});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_EQ(outcome.out, "REEL  Reel name  ok!\n");
  EXPECT_EQ(outcome.err, "oxmv: warning: " + file +
                             ": stopped at byte 12: record NAME claims 20 bytes, 16 are left"
                             " (truncated-record)\n");
}

TEST(Show, CountsWarningsWhenStrict) {
  const std::string file = data + "truncated-second-record.bin";
  EXPECT_EQ(run({"show", "--strict", file}).exitCode, 1);
  EXPECT_EQ(run({"show", "--strict", data + "eye-left.col1"}).exitCode, 0);
  EXPECT_EQ(run({"show", "--strict", file, "missing"}).exitCode, 3);
  const Outcome quiet = run({"show", "--strict", "--quiet", file});
  EXPECT_EQ(quiet.exitCode, 1);
  EXPECT_EQ(quiet.err, "");
}

TEST(Show, SaysOnlySoManyWarnings) {
  StreamBuilder stream;
  for (int i = 0; i < 25; ++i) stream.record("ABCD", 'c', "");
  const TempDir folder;
  writeFile(folder / "clip.colr", stream.bytes());
  const Outcome outcome = run({"show", folder / "clip.colr"});
  const auto lines = linesOf(outcome.err);
  ASSERT_EQ(lines.size(), 21u);
  EXPECT_EQ(lines.back(), "oxmv: warning: " + (folder / "clip.colr").string() +
                              ": 5 warnings more; oxmv check lists them all");
  EXPECT_EQ(Json::parse(run({"show", "--json", folder / "clip.colr"}).out)[0]["warnings"].size(),
            25u);
}

TEST(Show, SaysNothingOfTheEndOfControlPoints) {
  EXPECT_EQ(run({"show", data + "control-points.bin"}).err, "");
}

TEST(Show, SaysNothingOfAMarkerThatPromisesMore) {
  EXPECT_EQ(run({"show", data + "marker-raises-the-limit.bin"}).err, "");
}

TEST(Show, WarnsOfAFileThatIsTooShort) {
  const std::string file = data + "eleven-bytes.bin";
  const Outcome outcome = run({"show", file});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_EQ(outcome.out, "no tags\n");
  EXPECT_EQ(outcome.err, "oxmv: warning: " + file +
                             ": byte 0: 11 bytes are too few: a clip with tags has 12 or more"
                             " (too-short)\n");
}

TEST(Show, NotesSizesWhenVerbose) {
  const std::string file = data + "eye-left.col1";
  EXPECT_EQ(run({"show", "-v", file}).err, "oxmv: note: " + file + ": 52 bytes, 3 tags\n");
}

TEST(Show, GivesTheTagsOfEverySampleAsJson) {
  for (const std::string& name : oxmv::test::testDataNames("streams", ".json")) {
    const Outcome outcome = run({"show", "--json", "-q", data + name});
    ASSERT_EQ(outcome.exitCode, 0) << name;
    ASSERT_EQ(outcome.err, "") << name;
    const Json results = Json::parse(outcome.out);
    ASSERT_EQ(results.size(), 1u) << name;
    const Dictionary expected =
        oxmv::test::dictionaryFromJson(oxmv::test::testData("streams/" + name + ".json"));
    const Dictionary shown = dictionaryOf(results[0]["tags"]);
    EXPECT_EQ(shown, expected) << name;
    EXPECT_EQ(keysOf(shown), keysOf(expected)) << name;
  }
}

TEST(Show, GivesJsonOfAFixedShape) {
  EXPECT_EQ(run({"show", "--json", data + "unknown-tag-between.bin"}).out,
            "[\n{\"schema\":\"oxmv.show/1\",\"file\":\"" + data +
                "unknown-tag-between.bin\",\"guid\":\"00000000-0000-0000-0000-000000000000\","
                "\"tags\":{\"REEL\":\"A3\",\"TAKE\":3},\"warnings\":[{\"code\":\"unknown-tag\","
                "\"offset\":12,\"tag\":\"ZZZZ\",\"message\":\"ZZZZ: ignored, no such tag\"}],"
                "\"error\":null}\n]\n");
  const Json guid = Json::parse(run({"show", "--json", data + "clip-guid.bin"}).out);
  EXPECT_EQ(guid[0]["guid"], clipGuid);
}

TEST(Show, GivesAnObjectForAClipThatCannotBeRead) {
  const Outcome outcome = run({"show", "--json", "missing.colr", data + "eye-left.col1"});
  EXPECT_EQ(outcome.exitCode, 3);
  EXPECT_EQ(outcome.err, "oxmv: error: missing.colr: No such file or directory (missing)\n");
  const Json results = Json::parse(outcome.out);
  ASSERT_EQ(results.size(), 2u);
  EXPECT_EQ(results[0].dump(),
            "{\"schema\":\"oxmv.show/1\",\"file\":\"missing.colr\",\"guid\":null,\"tags\":null,"
            "\"warnings\":[],\"error\":{\"code\":\"missing\",\"message\":"
            "\"No such file or directory\"}}");
  EXPECT_TRUE(results[1]["error"].is_null());
}

TEST(Show, GivesOneResultALineAsNdjson) {
  const Outcome outcome =
      run({"show", "--ndjson", data + "eye-left.col1", "missing.colr", data + "eye-right.col2"});
  const auto lines = linesOf(outcome.out);
  ASSERT_EQ(lines.size(), 3u);
  EXPECT_EQ(Json::parse(lines[0])["file"], data + "eye-left.col1");
  EXPECT_EQ(Json::parse(lines[1])["error"]["code"], "missing");
  EXPECT_EQ("[\n" + lines[0] + "\n]\n", run({"show", "--json", data + "eye-left.col1"}).out);
}

TEST(Show, EscapesControlAndTurningCharactersInJson) {
  const TempDir folder;
  writeFile(folder / "clip.colr",
            StreamBuilder().record("REEL", 'c', "\"\\\x1B\n\xE2\x80\xAE\xC3\xA9\xC2\x85").bytes());
  const Outcome outcome = run({"show", "--json", folder / "clip.colr"});
  EXPECT_NE(outcome.out.find(R"("REEL":"\"\\\u001b\u000a\u202e)"
                             "\xC3\xA9"
                             R"(\u0085")"),
            std::string::npos)
      << outcome.out;
}

TEST(Show, NamesFilesInJsonWhateverTheirBytes) {
  const Json results = Json::parse(run({"show", "--json", "a\xFF\"b"}).out);
  EXPECT_EQ(results[0]["file"], "a\\xFF\"b");
}

TEST(Show, GivesNoResultsAsAnEmptyArray) {
  EXPECT_EQ(run({"show", "--json", "--files-from", "-"}, "").out, "[]\n");
  EXPECT_EQ(run({"show", "--ndjson", "--files-from", "-"}, "").out, "");
}

TEST(Show, GivesColumnsAsCsv) {
  const Outcome outcome = run({"show", "--csv", "--columns", "REEL,White balance, KWRd,TAG,COL2",
                               data + "typical-clip.colr", data + "eye-left.col1"});
  EXPECT_EQ(outcome.exitCode, 0);
  const auto lines = linesOf(outcome.out);
  ASSERT_EQ(lines.size(), 3u);
  EXPECT_EQ(lines[0], "file,REEL,White balance,KWRd,TAG,COL2");
  EXPECT_EQ(lines[1],
            data +
                "typical-clip.colr,A001_C003,1.0 1.2 1.05 1.5,"
                "\"[\"\"exterior\\u0000\\u0000\\u0000\\u0000\"\",\"\"day\\u0000\"\"]\","
                "\"{\"\"ISO\"\":400,\"\"Lens\"\":\"\"35mm T1.5\"\",\"\"Filter\"\":\"\"ND6\"\","
                "\"\"Height\"\":140}\",");
  EXPECT_EQ(lines[2], data + "eye-left.col1,A001_C003L,,,,");
}

TEST(Show, QuotesFieldsOfCsv) {
  const TempDir folder;
  writeFile(folder / "a,b.colr",
            StreamBuilder().record("REEL", 'c', "a \"b\"\n").record("NAME", 'c', " x").bytes());
  EXPECT_EQ(
      run({"show", "--csv", "--columns", "REEL,NAME", folder / "a,b.colr"}).out,
      "file,REEL,NAME\n\"" + folder.path().string() + "/a,b.colr\",\"a \"\"b\"\"\\x0A\",\" x\"\n");
}

TEST(Show, LeavesAClipThatCannotBeReadOutOfCsv) {
  const Outcome outcome = run({"show", "--csv", "--columns", "REEL", "missing"});
  EXPECT_EQ(outcome.exitCode, 3);
  EXPECT_EQ(outcome.out, "file,REEL\n");
}

TEST(Show, AnswersAMistypedColumnWithTheNearest) {
  const Outcome outcome = run({"show", "--csv", "--columns", "REEL,Wite balance", "missing"});
  EXPECT_EQ(outcome.exitCode, 2);
  EXPECT_EQ(outcome.out, "");
  EXPECT_EQ(outcome.err,
            "oxmv: error: no tag \"Wite balance\"; did you mean WBAL (White balance)?"
            " (unknown-tag)\n");
  EXPECT_EQ(run({"show", "--csv", "--columns", "reel", "missing"}).err,
            "oxmv: error: no tag \"reel\"; did you mean REEL (Reel name) or"
            " REEA (Reel name ALT)? (unknown-tag)\n");
  EXPECT_EQ(run({"show", "--csv", "--columns", "REEL,", "missing"}).err,
            "oxmv: error: no tag \"\" (unknown-tag)\n");
}

TEST(Show, WantsCsvAndColumnsTogether) {
  for (const auto& flags :
       {std::vector<std::string>{"--csv"}, std::vector<std::string>{"--columns", "REEL"}}) {
    std::vector<std::string> arguments = {"show", "missing"};
    arguments.insert(arguments.end(), flags.begin(), flags.end());
    const Outcome outcome = run(arguments);
    EXPECT_EQ(outcome.exitCode, 2);
    EXPECT_EQ(outcome.err, "oxmv: error: --csv and --columns need each other (bad-flags)\n");
  }
}

TEST(Show, ReadsNamesFromAFile) {
  const TempDir folder;
  writeFile(folder / "list", data + "eye-left.col1\n\n" + data + "eye-right.col2");
  const Outcome outcome = run({"show", "--csv", "--columns", "REEL", data + "raw-data.bin",
                               "--files-from", folder / "list"});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_EQ(outcome.out, "file,REEL\n" + data + "raw-data.bin,\n" + data +
                             "eye-left.col1,A001_C003L\n" + data + "eye-right.col2,A001_C003R\n");
}

TEST(Show, ReadsNamesThatEndWithNul) {
  const TempDir folder;
  writeFile(folder / "a\nb.colr", StreamBuilder().record("REEL", 'c', "x").bytes());
  const std::string list = (folder / "a\nb.colr").string() + '\0' + data + "eye-left.col1" + '\0';
  const Outcome outcome =
      run({"show", "--csv", "--columns", "REEL", "--files-from", "-", "-0"}, list);
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_EQ(outcome.out, "file,REEL\n" + folder.path().string() + "/a\\x0Ab.colr,x\n" + data +
                             "eye-left.col1,A001_C003L\n");
}

TEST(Show, NamesAListThatCannotBeReadAndDoesTheOthers) {
  const Outcome outcome = run({"show", data + "eye-left.col1", "--files-from", "missing-list"});
  EXPECT_EQ(outcome.exitCode, 3);
  EXPECT_EQ(linesOf(outcome.out).size(), 3u);
  EXPECT_EQ(outcome.err, "oxmv: error: missing-list: No such file or directory (missing)\n");
}

TEST(Show, WantsSomethingToShow) {
  const Outcome outcome = run({"show"});
  EXPECT_EQ(outcome.exitCode, 2);
  EXPECT_EQ(outcome.err,
            "oxmv: error: name a file, or several; - is standard input (missing-file)\n");
  EXPECT_EQ(run({"show", "x", "--null"}).err,
            "oxmv: error: --null goes with --files-from (bad-flags)\n");
}

}  // namespace
}  // namespace oxmv::cli::test
