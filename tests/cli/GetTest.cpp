#include <string>

#include <gtest/gtest.h>

#include "tests/cli/CommandRunner.h"
#include "tests/support/StreamBuilder.h"
#include "tests/support/TempDir.h"

namespace oxmv::cli::test {
namespace {

using oxmv::test::StreamBuilder;
using oxmv::test::TempDir;

const std::string examples = OXMV_SOURCE_DIR "/examples/";
const std::string walk = examples + "walk.colr";
const std::string groups = examples + "groups-and-lists.colr";

std::string valueOf(const std::string& clip, const std::string& tag) {
  const Outcome outcome = run({"get", clip, tag});
  EXPECT_EQ(outcome.exitCode, 0) << outcome.err;
  EXPECT_EQ(outcome.err, "");
  return outcome.out;
}

TEST(Get, GivesValuesOneALine) {
  const Outcome outcome = run({"get", walk, "REEL", "WBAL", "TAKE", "REEL"});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_EQ(outcome.out, "A001\n1.0 1.25 1.0 1.5\n3\n");
  EXPECT_EQ(outcome.err, "");
}

TEST(Get, TakesLabels) {
  EXPECT_EQ(valueOf(walk, "White balance"), "1.0 1.25 1.0 1.5\n");
  EXPECT_EQ(valueOf(walk, "reel name"), "A001\n");
}

TEST(Get, LooksIntoNestedTagsAndGroups) {
  EXPECT_EQ(valueOf(walk, "COL1/SATU"), "0.5\n");
  EXPECT_EQ(valueOf(walk, "COL1/Saturation"), "0.5\n");
  EXPECT_EQ(valueOf(walk, "TAG/ISO"), "400\n");
  EXPECT_EQ(valueOf(walk, "TAG /ISO"), "400\n");
  EXPECT_EQ(valueOf(groups, "COL2/COL1/EXPS"), "2.0\n");
}

TEST(Get, GivesEveryKindOfValueBare) {
  EXPECT_EQ(valueOf(groups, "KWRd"), "exterior\nday\n");
  EXPECT_EQ(valueOf(groups, "SCPg"), "12 14 15\n");
  EXPECT_EQ(valueOf(groups, "FREE"), "0001020304050607\n");
  EXPECT_EQ(valueOf(groups, "DSPm"), "[{\"ZOOM\":2.0},{\"REEL\":\"A001_C007\"}]\n");
  EXPECT_EQ(valueOf(walk, "COL1"), "{\"SATU\":0.5}\n");
  EXPECT_EQ(valueOf(walk, "TAG"), "{\"ISO\":400}\n");
}

TEST(Get, FindsNamesWithoutTheNulsAtTheirEnd) {
  const TempDir folder;
  writeFile(folder / "clip.colr", StreamBuilder()
                                      .record("REGN", 'c', std::string("Lens\0\0\0\0", 8))
                                      .record("REGV", 'L', std::string("\5\0\0\0", 4))
                                      .bytes());
  EXPECT_EQ(valueOf(folder / "clip.colr", "REG/Lens"), "5\n");
}

TEST(Get, EscapesWhatATerminalMustNotGet) {
  const TempDir folder;
  const std::string clip = (folder / "clip.colr").string();
  writeFile(folder / "clip.colr", StreamBuilder().record("REEL", 'c', "a\x1B[31m\nb").bytes());
  EXPECT_EQ(valueOf(clip, "REEL"), "a\\x1B[31m\\x0Ab\n");
  EXPECT_EQ(run({"get", "--raw", clip, "REEL"}).out, "a\x1B[31m\nb\n");
  const Outcome outcome = runOnTerminal({"get", "--raw", "--color", "never", clip, "REEL"});
  EXPECT_EQ(outcome.exitCode, 4);
  EXPECT_EQ(outcome.out,
            "oxmv: refused: standard output: the value is binary, and this is a terminal"
            " (binary-to-terminal)\n");
}

TEST(Get, GivesRawValuesAsTheyAre) {
  EXPECT_EQ(run({"get", "--raw", groups, "FREE"}).out, std::string("\0\1\2\3\4\5\6\7", 8));
  EXPECT_EQ(run({"get", "--raw", groups, "KWRd"}).out, std::string("exterior\nday\0\n", 14));
  EXPECT_EQ(run({"get", "--raw", walk, "REEL", "TAKE"}).out, "A001\n3\n");
  EXPECT_EQ(runOnTerminal({"get", "--raw", groups, "FREE"}).exitCode, 4);
  EXPECT_EQ(runOnTerminal({"get", "--raw", walk, "REEL"}).out, "A001\n");
}

TEST(Get, SaysNoWhenATagIsAbsent) {
  const Outcome outcome = run({"get", walk, "NAME", "REEL", "COL1/WBAL", "TAG/Lens"});
  EXPECT_EQ(outcome.exitCode, 1);
  EXPECT_EQ(outcome.out, "A001\n");
  EXPECT_EQ(outcome.err, "oxmv: error: " + walk + ": NAME is not there (absent)\n" +
                             "oxmv: error: " + walk + ": COL1/WBAL is not there (absent)\n" +
                             "oxmv: error: " + walk + ": TAG /Lens is not there (absent)\n");
}

TEST(Get, WarnsOfDamageThatMayBeTheReason) {
  const std::string damaged = OXMV_TEST_DATA "/streams/truncated-second-record.bin";
  const Outcome absent = run({"get", damaged, "NAME"});
  EXPECT_EQ(absent.exitCode, 1);
  EXPECT_NE(absent.err.find("(truncated-record)"), std::string::npos) << absent.err;
  EXPECT_EQ(run({"get", damaged, "REEL"}).err, "");
}

TEST(Get, GivesJson) {
  const Outcome outcome = run({"get", "--json", walk, "TAG/ISO", "KWRd", "NAME"});
  EXPECT_EQ(outcome.exitCode, 1);
  const std::string object = "{\"schema\":\"oxmv.get/1\",\"file\":\"" + walk +
                             "\",\"tags\":{\"TAG /ISO\":400,\"KWRd\":[\"day\\u0000\"],"
                             "\"NAME\":null},\"error\":null}\n";
  EXPECT_EQ(outcome.out, "[\n" + object + "]\n");
  EXPECT_EQ(run({"get", "--ndjson", walk, "TAG/ISO", "KWRd", "NAME"}).out, object);
}

TEST(Get, NamesAClipThatCannotBeRead) {
  const Outcome outcome = run({"get", "--ndjson", "missing", "REEL"});
  EXPECT_EQ(outcome.exitCode, 3);
  EXPECT_EQ(outcome.err, "oxmv: error: missing: No such file or directory (missing)\n");
  EXPECT_EQ(outcome.out,
            "{\"schema\":\"oxmv.get/1\",\"file\":\"missing\",\"tags\":null,"
            "\"error\":{\"code\":\"missing\",\"message\":\"No such file or directory\"}}\n");
  EXPECT_EQ(run({"get", OXMV_TEST_DATA, "REEL"}).exitCode, 3);
}

TEST(Get, ReadsStandardInput) {
  EXPECT_EQ(run({"get", "-", "REEL"}, readFile(walk)).out, "A001\n");
}

TEST(Get, RefusesWrongUse) {
  const auto errorOf = [](const std::vector<std::string>& arguments) {
    const Outcome outcome = run(arguments);
    EXPECT_EQ(outcome.exitCode, 2);
    EXPECT_EQ(outcome.out, "");
    return outcome.err;
  };
  EXPECT_EQ(errorOf({"get", walk}), "oxmv: error: get needs CLIP TAG... (missing-words)\n");
  EXPECT_EQ(errorOf({"get", walk, "REEL", "RELE"}),
            "oxmv: error: no tag \"RELE\"; did you mean REEL (Reel name)? (unknown-tag)\n");
  EXPECT_EQ(errorOf({"get", walk, "REEL/TAKE"}),
            "oxmv: error: \"REEL/TAKE\": REEL holds no other tags (bad-path)\n");
  EXPECT_EQ(errorOf({"get", walk, "REEL", "--raw", "--json"}),
            "oxmv: error: --raw and JSON do not go together (bad-flags)\n");
}

}  // namespace
}  // namespace oxmv::cli::test
