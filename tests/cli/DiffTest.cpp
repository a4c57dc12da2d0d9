#include <string>

#include <gtest/gtest.h>

#include "tests/cli/CommandRunner.h"
#include "tests/support/TempDir.h"

namespace oxmv::cli::test {
namespace {

using oxmv::test::TempDir;

const std::string examples = OXMV_SOURCE_DIR "/examples/";
const std::string walk = examples + "walk.colr";

// Of two clips that are made of tag JSON.
Outcome diff(const std::string& a, const std::string& b,
             const std::vector<std::string>& flags = {}) {
  const TempDir folder;
  EXPECT_EQ(run({"encode", "-", "-o", folder / "a"}, a).exitCode, 0);
  EXPECT_EQ(run({"encode", "-", "-o", folder / "b"}, b).exitCode, 0);
  std::vector<std::string> arguments = {"diff", folder / "a", folder / "b"};
  arguments.insert(arguments.end(), flags.begin(), flags.end());
  Outcome outcome = run(arguments);
  EXPECT_EQ(outcome.err, "");
  return outcome;
}

TEST(Diff, SaysNothingOfEqualTags) {
  const Outcome same = run({"diff", walk, walk});
  EXPECT_EQ(same.exitCode, 0);
  EXPECT_EQ(same.out, "");
  EXPECT_EQ(same.err, "");
  EXPECT_EQ(diff(R"({"REEL":"a","TAKE":1})", R"({"TAKE":1,"REEL":"a"})").exitCode, 0);
}

TEST(Diff, NamesEachTagThatDiffers) {
  const Outcome outcome = diff(R"({"REEL":"a","TAKE":1,"NAME":"x","WBAL":[1.0,1.0,1.0,1.0]})",
                               R"({"REEL":"b","NAME":"x","SATU":0.5,"WBAL":[1.0,2.0,1.0,1.0]})");
  EXPECT_EQ(outcome.exitCode, 1);
  EXPECT_EQ(outcome.out,
            "~ REEL: a -> b\n"
            "- TAKE: 1\n"
            "~ WBAL: 1.0 1.0 1.0 1.0 -> 1.0 2.0 1.0 1.0\n"
            "+ SATU: 0.5\n");
}

TEST(Diff, LooksIntoNestedTagsGroupsAndLists) {
  const Outcome outcome = diff(
      R"({"KWRd":["wide","foggy\u0000\u0000\u0000"],"DSPm":[{"ZOOM":1.0}],"TAG ":{"ISO":400,"Lens":"35mm"},"COL1":{"SATU":0.5}})",
      R"({"KWRd":["wide"],"DSPm":[{"ZOOM":2.0},{"TILT":1.0}],"TAG ":{"ISO":500},"COL2":{"SATU":0.5}})");
  EXPECT_EQ(outcome.out,
            "- KWRd[1]: foggy (+3 NUL)\n"
            "~ DSPm[0]/ZOOM: 1.0 -> 2.0\n"
            "+ DSPm[1]/TILT: 1.0\n"
            "~ TAG /ISO: 400 -> 500\n"
            "- TAG /Lens: 35mm\n"
            "- COL1/SATU: 0.5\n"
            "+ COL2/SATU: 0.5\n");
}

TEST(Diff, TellsKindsApart) {
  EXPECT_EQ(diff(R"({"TAG ":{"a":5}})", R"({"TAG ":{"a":"5"}})").out, "~ TAG /a: 5 -> \"5\"\n");
}

TEST(Diff, ShowsLongValuesWholeWhereTheirStartsAreTheSame) {
  EXPECT_EQ(diff(R"({"TAKE":1,"FREE":{"$data":"000102030405060708090a0b0c0d0e0f01020304"}})",
                 R"({"TAKE":1,"FREE":{"$data":"000102030405060708090a0b0c0d0e0f01020305"}})")
                .out,
            "~ FREE: {\"$data\":\"000102030405060708090a0b0c0d0e0f01020304\"} -> "
            "{\"$data\":\"000102030405060708090a0b0c0d0e0f01020305\"}\n");
}

TEST(Diff, CutsLongValuesUnlessVerbose) {
  const std::string a = R"({"FREE":{"$data":"000102030405060708090a0b0c0d0e0f10111213"},"TAKE":1})";
  EXPECT_EQ(diff(a, R"({"TAKE":1})").out,
            "- FREE: 000102030405060708090a0b0c0d0e0f... (20 bytes)\n");
  EXPECT_EQ(diff(a, R"({"TAKE":1})", {"-v"}).out,
            "- FREE: 000102030405060708090a0b0c0d0e0f10111213 (20 bytes)\n");
}

TEST(Diff, GivesJson) {
  const TempDir folder;
  const std::string copy = (folder / "copy.colr").string();
  writeFile(copy, readFile(walk));
  EXPECT_EQ(run({"set", copy, "REEL=A002", "SATU=1"}).exitCode, 0);
  EXPECT_EQ(run({"unset", copy, "TAKE"}).exitCode, 0);
  const Outcome outcome = run({"diff", "--json", walk, copy});
  EXPECT_EQ(outcome.exitCode, 1);
  EXPECT_EQ(outcome.out,
            "[\n{\"schema\":\"oxmv.diff/1\",\"file\":\"" + walk + "\",\"other\":\"" + copy +
                "\",\"differences\":["
                "{\"tag\":\"REEL\",\"change\":\"changed\",\"before\":\"A001\",\"after\":\"A002\"},"
                "{\"tag\":\"TAKE\",\"change\":\"removed\",\"before\":3,\"after\":null},"
                "{\"tag\":\"SATU\",\"change\":\"added\",\"before\":null,\"after\":1.0}],"
                "\"error\":null}\n]\n");
  const Outcome same = run({"diff", "--ndjson", walk, walk});
  EXPECT_EQ(same.exitCode, 0);
  EXPECT_NE(same.out.find("\"differences\":[],\"error\":null}\n"), std::string::npos) << same.out;
}

TEST(Diff, NamesAClipThatCannotBeRead) {
  const Outcome outcome = run({"diff", walk, "missing", "--ndjson"});
  EXPECT_EQ(outcome.exitCode, 3);
  EXPECT_EQ(outcome.err, "oxmv: error: missing: No such file or directory (missing)\n");
  EXPECT_NE(outcome.out.find("\"differences\":null,\"error\":{\"code\":\"missing\""),
            std::string::npos)
      << outcome.out;
  EXPECT_EQ(run({"diff", "missing", walk}).out, "");
}

TEST(Diff, WarnsOfWhatReadersIgnore) {
  const std::string damaged = OXMV_TEST_DATA "/streams/truncated-second-record.bin";
  const Outcome outcome = run({"diff", damaged, damaged});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_NE(outcome.err.find("(truncated-record)"), std::string::npos) << outcome.err;
  EXPECT_EQ(run({"diff", "--strict", damaged, damaged}).exitCode, 1);
  EXPECT_EQ(run({"diff", "-q", damaged, damaged}).err, "");
}

TEST(Diff, ReadsStandardInputOnce) {
  EXPECT_EQ(run({"diff", "-", walk}, readFile(walk)).exitCode, 0);
  EXPECT_EQ(run({"diff", "-", "-"}).exitCode, 2);
  EXPECT_EQ(run({"diff", walk}).err, "oxmv: error: diff needs A B (missing-words)\n");
}

}  // namespace
}  // namespace oxmv::cli::test
