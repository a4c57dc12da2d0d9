#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "tests/cli/CommandRunner.h"
#include "tests/cli/EditedClip.h"

namespace oxmv::cli::test {
namespace {

using Words = std::vector<std::string>;

Outcome unset(const EditedClip& clip, const Words& words) {
  Words arguments = {"unset", clip.path()};
  arguments.insert(arguments.end(), words.begin(), words.end());
  return run(arguments);
}

TEST(Unset, RemovesTagsAndNothingElse) {
  const EditedClip clip;
  const Outcome outcome = unset(clip, {"REEL", "White balance", "KWRd"});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_EQ(outcome.out + outcome.err, "");
  EXPECT_EQ(recordsOf(clip.content(), {}), recordsOf(clip.original(), {"REEL", "WBAL", "KWRd"}));
  EXPECT_EQ(clip.files(), 1);
}

TEST(Unset, RemovesEveryTagOfAClip) {
  const EditedClip clip("walk.colr");
  EXPECT_EQ(unset(clip, {"TIMC", "REEL", "WBAL", "KWRd", "TAG", "TAKE", "COL1"}).exitCode, 0);
  EXPECT_EQ(clip.content(), "");
}

TEST(Unset, RemovesNestedTagsAndEntriesOfGroups) {
  const EditedClip clip("groups-and-lists.colr");
  EXPECT_EQ(unset(clip, {"COL2/COL1/EXPS", "TAG/Lens"}).exitCode, 0);
  EXPECT_EQ(run({"get", clip.path(), "TAG"}).out,
            "{\"ISO\":400,\"Filter\":\"ND6\",\"Height\":140}\n");
  EXPECT_EQ(run({"get", clip.path(), "COL2/SATU"}).out, "0.25\n");
  EXPECT_EQ(run({"get", clip.path(), "COL2/COL1/EXPS"}).exitCode, 1);
}

TEST(Unset, SaysNoWhenATagIsAbsentAndRemovesTheOthers) {
  const EditedClip clip("walk.colr");
  const Outcome outcome = unset(clip, {"NAME", "REEL", "COL2/SATU"});
  EXPECT_EQ(outcome.exitCode, 1);
  EXPECT_EQ(outcome.err, "oxmv: error: " + clip.path() + ": NAME is not there (absent)\n" +
                             "oxmv: error: " + clip.path() + ": COL2/SATU is not there (absent)\n");
  EXPECT_EQ(recordsOf(clip.content(), {}), recordsOf(clip.original(), {"REEL"}));
  const std::string rest = clip.content();
  EXPECT_EQ(unset(clip, {"REEL"}).exitCode, 1);
  EXPECT_EQ(clip.content(), rest);
}

TEST(Unset, ShowsWhatWouldGoOnADryRun) {
  const EditedClip clip("walk.colr");
  const Outcome outcome = unset(clip, {"--dry-run", "REEL", "TAG/ISO"});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_EQ(outcome.out, "REEL: A001 -> (absent)\nTAG /ISO: 400 -> (absent)\n");
  EXPECT_TRUE(clip.isUntouched());
}

TEST(Unset, KeepsTheOldFileWhenAsked) {
  const EditedClip clip("walk.colr");
  EXPECT_EQ(unset(clip, {"--backup", "REEL"}).exitCode, 0);
  EXPECT_EQ(readFile(clip.path() + '~'), clip.original());
}

TEST(Unset, ReadsStandardInputAndWritesStandardOutput) {
  const EditedClip clip("walk.colr");
  EXPECT_EQ(unset(clip, {"REEL"}).exitCode, 0);
  EXPECT_EQ(run({"unset", "-", "REEL"}, clip.original()).out, clip.content());
  const Outcome absent = run({"unset", "-", "NAME"}, clip.original());
  EXPECT_EQ(absent.exitCode, 1);
  EXPECT_EQ(absent.out, clip.original());
}

TEST(Unset, NamesAClipThatCannotBeRead) {
  const Outcome outcome = run({"unset", "missing", "REEL"});
  EXPECT_EQ(outcome.exitCode, 3);
  EXPECT_EQ(outcome.err, "oxmv: error: missing: No such file or directory (missing)\n");
}

TEST(Unset, RefusesWrongUse) {
  const EditedClip clip("walk.colr");
  EXPECT_EQ(unset(clip, {"RELE"}).exitCode, 2);
  EXPECT_EQ(unset(clip, {}).err, "oxmv: error: unset needs CLIP TAG... (missing-words)\n");
  EXPECT_EQ(unset(clip, {"REEL", "--create"}).err,
            "oxmv: error: unset takes no --create; see oxmv help unset (bad-flags)\n");
  EXPECT_TRUE(clip.isUntouched());
}

}  // namespace
}  // namespace oxmv::cli::test
