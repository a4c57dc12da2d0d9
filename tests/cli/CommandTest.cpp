#include <gtest/gtest.h>

#include "tests/cli/CommandRunner.h"
#include "tests/support/StreamBuilder.h"
#include "tests/support/TempDir.h"

// What holds for every verb: calling it, help, messages, colours, standard streams, exit codes.

namespace oxmv::cli::test {
namespace {

using oxmv::test::StreamBuilder;
using oxmv::test::TempDir;

const std::string data = OXMV_TEST_DATA "/streams/";
const std::string clip = data + "reel-twice-last-wins.bin";

void expectUsageError(const Outcome& outcome, const std::string& message) {
  EXPECT_EQ(outcome.exitCode, 2);
  EXPECT_EQ(outcome.out, "");
  EXPECT_EQ(outcome.err, "oxmv: error: " + message + "\n");
}

TEST(Command, SaysInSixLinesWhatItIs) {
  const Outcome bare = run({});
  EXPECT_EQ(bare.exitCode, 0);
  EXPECT_EQ(linesOf(bare.out).size(), 6u);
  EXPECT_TRUE(bare.out.starts_with("oxmv "));
  EXPECT_TRUE(bare.out.ends_with("Help: oxmv help, oxmv help VERB\n"));
  EXPECT_EQ(bare.err, "");
}

TEST(Command, HelpBeginsWithExamples) {
  const Outcome help = run({"--help"});
  EXPECT_EQ(help.exitCode, 0);
  EXPECT_TRUE(help.out.starts_with("Examples\n  oxmv show "));
  EXPECT_EQ(help.err, "");
  EXPECT_EQ(run({"help"}).out, help.out);
  EXPECT_EQ(run({"-h"}).out, help.out);
}

TEST(Command, HelpOfEachVerbBeginsWithExamples) {
  for (const std::string verb : {"show", "get", "set", "unset", "diff", "dump", "check", "encode",
                                 "tags", "prefs", "paths", "demo", "help", "version"}) {
    const Outcome help = run({"help", verb});
    EXPECT_EQ(help.exitCode, 0) << verb;
    EXPECT_EQ(help.err, "") << verb;
    EXPECT_TRUE(help.out.starts_with("Examples\n  oxmv " + verb)) << help.out;
    EXPECT_NE(help.out.find("\nUse\n  oxmv " + verb), std::string::npos) << help.out;
    EXPECT_NE(run({"help"}).out.find("\n  " + verb), std::string::npos);
    EXPECT_EQ(run({verb, "--help"}).out, help.out);
    EXPECT_EQ(run({"-h", verb, "ignored"}).out, help.out);
  }
}

TEST(Command, SaysItsVersion) {
  const Outcome outcome = run({"version"});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_TRUE(outcome.out.starts_with("oxmv ")) << outcome.out;
  EXPECT_EQ(run({"--version"}).out, outcome.out);
  EXPECT_EQ(run({"show", "--version"}).out, outcome.out);
}

TEST(Command, AnswersAMistypedVerbWithTheNearest) {
  expectUsageError(run({"shwo", clip}), "no verb \"shwo\"; did you mean show? (unknown-verb)");
  expectUsageError(run({"help", "enc"}), "no verb \"enc\"; did you mean encode? (unknown-verb)");
  expectUsageError(run({"frobnicate"}),
                   "no verb \"frobnicate\"; oxmv help lists them (unknown-verb)");
  expectUsageError(run({"s\x1B[2J"}), "no verb \"s\\x1B[2J\"; oxmv help lists them (unknown-verb)");
}

TEST(Command, AnswersAMistypedFlagWithTheNearest) {
  expectUsageError(run({"show", clip, "--jsn"}),
                   "no flag --jsn; did you mean --json? (unknown-flag)");
  expectUsageError(run({"show", clip, "-json"}),
                   "no flag -json; did you mean --json or --ndjson? (unknown-flag)");
  expectUsageError(run({"show", clip, "-x"}), "no flag -x (unknown-flag)");
  expectUsageError(run({"show", clip, "--colour=always"}),
                   "no flag --colour; did you mean --color? (unknown-flag)");
}

TEST(Command, RefusesFlagsThatMeanNothing) {
  expectUsageError(run({"tags", "--csv"}), "tags takes no --csv; see oxmv help tags (bad-flags)");
  expectUsageError(run({"show", clip, "--output", "x"}),
                   "show takes no --output; see oxmv help show (bad-flags)");
  expectUsageError(run({"--quiet"}), "these flags need a verb; see oxmv help (missing-verb)");
  expectUsageError(run({"show", clip, "-q", "-v"}),
                   "--quiet and --verbose do not go together (bad-flags)");
  expectUsageError(run({"show", clip, "--json", "--ndjson"}),
                   "--json and --ndjson do not go together (bad-flags)");
  expectUsageError(run({"show", clip, "--json=yes"}), "--json takes no value (bad-value)");
  expectUsageError(run({"encode", "x.json", "-o"}), "--output needs OUT behind it (bad-value)");
  expectUsageError(run({"show", clip, "--color", "pink"}),
                   "--color is auto, always, never, not \"pink\" (bad-value)");
}

TEST(Command, RefusesTheWrongNumberOfWords) {
  expectUsageError(run({"dump"}), "dump needs FILE (missing-words)");
  expectUsageError(run({"dump", clip, clip}), "dump takes FILE, not 2 words (surplus-words)");
  expectUsageError(run({"version", "please"}), "version takes nothing behind it (surplus-words)");
  expectUsageError(run({"demo"}), "demo needs DIR (missing-words)");
}

TEST(Command, TakesFlagsBeforeAndBehindTheVerb) {
  const std::string expected = run({"show", "--json", clip}).out;
  EXPECT_EQ(run({"--json", "show", clip}).out, expected);
  EXPECT_EQ(run({"show", clip, "--json"}).out, expected);
  EXPECT_NE(run({"show", clip}).out, expected);
}

TEST(Command, TakesEverythingBehindTwoDashesAsWords) {
  const TempDir folder;
  writeFile(folder / "--json", StreamBuilder().record("REEL", 'c', "x").bytes());
  const Outcome outcome = runShell("cd " + folder.path().string() + " && \"$OXMV\" show -- --json");
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_EQ(outcome.out, "REEL  Reel name  x\n");
}

TEST(Command, TakesNamesAsTheyStand) {
  const TempDir folder;
  for (const char* name : {"[a,b]", "a b", "%7B", "@x", "Z=1", "ö"}) {
    writeFile(folder / name, StreamBuilder().record("REEL", 'c', "x").bytes());
    EXPECT_EQ(run({"show", folder / name}).out, "REEL  Reel name  x\n") << name;
  }
}

TEST(Command, NamesAMissingFileAndDoesTheOthers) {
  const Outcome outcome = run({"show", data + "missing", clip});
  EXPECT_EQ(outcome.exitCode, 3);
  EXPECT_EQ(outcome.out, clip + "\nREEL  Reel name  second\n");
  EXPECT_EQ(outcome.err, "oxmv: error: " + data + "missing: No such file or directory (missing)\n");
}

TEST(Command, NamesWhatIsNoFile) {
  const TempDir folder;
  EXPECT_EQ(runShell("mkfifo " + (folder / "pipe").string()).exitCode, 0);
  const Outcome outcome = run({"show", folder.path(), folder / "pipe", "/dev/null"});
  EXPECT_EQ(outcome.exitCode, 3);
  EXPECT_EQ(outcome.out, "");
  EXPECT_EQ(outcome.err, "oxmv: error: " + folder.path().string() +
                             ": Is a directory (not-a-file)\n" + "oxmv: error: " +
                             (folder / "pipe").string() + ": Not a regular file (not-a-file)\n" +
                             "oxmv: error: /dev/null: Not a regular file (not-a-file)\n");
}

TEST(Command, NamesAFileThatItMayNotRead) {
  const TempDir folder;
  writeFile(folder / "secret.colr", StreamBuilder().record("REEL", 'c', "x").bytes());
  std::filesystem::permissions(folder.path(), std::filesystem::perms(0755));
  std::filesystem::permissions(folder / "secret.colr", std::filesystem::perms(0));
  const std::string name = (folder / "secret.colr").string();
  // Root may read everything.
  const Outcome outcome =
      runShell("if [ \"$(id -u)\" != 0 ]; then exec \"$OXMV\" show " + name + "; fi\n" +
               "command -v setpriv >/dev/null || exit 99\n" +
               "exec setpriv --reuid=65534 --regid=65534 --clear-groups \"$OXMV\" show " + name);
  if (outcome.exitCode == 99 || outcome.exitCode > 125) GTEST_SKIP() << outcome.err;
  EXPECT_EQ(outcome.exitCode, 3);
  EXPECT_EQ(outcome.err, "oxmv: error: " + name + ": Permission denied (unreadable)\n");
}

TEST(Command, ShowsNamesOfFilesWithoutTheirControlCharacters) {
  EXPECT_EQ(run({"show", "a\x1B[31m\nb"}).err,
            "oxmv: error: a\\x1B[31m\\x0Ab: No such file or directory (missing)\n");
  EXPECT_EQ(run({"show", "a\xFF"}).err,
            "oxmv: error: a\\xFF: No such file or directory (missing)\n");
}

TEST(Command, EndsQuietlyWhenThePipeIsClosed) {
  std::string all;
  for (int i = 0; i < 200; ++i) all += " \"$CLIP\"";
  const Outcome outcome = runShell("CLIP=" + data + "typical-clip.colr; { \"$OXMV\" show" + all +
                                   "; echo $? >&2; } | head -1 >/dev/null");
  EXPECT_EQ(outcome.err, "3\n");
}

TEST(Command, NamesAnOutputThatIsFull) {
  const std::vector<std::string> calls = {"show " + clip, "tags --json",  "help", "",
                                          "dump " + clip, "encode - -o -"};
  for (const std::string& call : calls) {
    const Outcome outcome = runShell("echo '{\"TAKE\":1}' | \"$OXMV\" " + call + " >/dev/full");
    EXPECT_EQ(outcome.exitCode, 3) << call;
    EXPECT_EQ(outcome.err, "oxmv: error: standard output: No space left on device (write-failed)\n")
        << call;
  }
}

TEST(Command, NamesAnOutputThatIsClosed) {
  const Outcome outcome = runShell("\"$OXMV\" show " + clip + " >&-");
  EXPECT_EQ(outcome.exitCode, 3);
  EXPECT_EQ(outcome.err, "oxmv: error: standard output: Bad file descriptor (write-failed)\n");
}

TEST(Command, PutsNoMessageInAFileThatItWrites) {
  const TempDir folder;
  const std::string made = (folder / "made.colr").string();
  const Outcome outcome =
      runShell("echo '{\"TAKE\":1}' | \"$OXMV\" encode -v - -o " + made + " 2>&- >&-");
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_EQ(readFile(made).size(), 12u);
}

TEST(Command, WritesNothingToAClosedStandardError) {
  const Outcome outcome = runShell("\"$OXMV\" show " + data + "missing 2>&-");
  EXPECT_EQ(outcome.exitCode, 3);
  EXPECT_EQ(outcome.out, "");
}

TEST(Command, ReadsStandardInputFromAPipe) {
  const Outcome outcome = runShell("cat " + clip + " | \"$OXMV\" show -");
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_EQ(outcome.out, "REEL  Reel name  second\n");
}

TEST(Command, NamesAStandardInputThatCannotBeRead) {
  const Outcome closed = runShell("\"$OXMV\" show - <&-");
  EXPECT_EQ(closed.exitCode, 3);
  EXPECT_EQ(closed.err, "oxmv: error: standard input: Bad file descriptor (unreadable)\n");
  const Outcome folder = runShell("\"$OXMV\" show - </");
  EXPECT_EQ(folder.exitCode, 3);
  EXPECT_EQ(folder.err, "oxmv: error: standard input: Is a directory (not-a-file)\n");
}

TEST(Command, ReadsStandardInputOnce) {
  expectUsageError(run({"show", "-", "-"}),
                   "standard input can be read only once (standard-input-twice)");
  expectUsageError(run({"show", "-", "--files-from", "-"}),
                   "standard input can be read only once (standard-input-twice)");
}

TEST(Command, IsColouredOnATerminalOnly) {
  const std::string coloured = "\x1B[36mREEL\x1B[0m  \x1B[2mReel name\x1B[0m  second\n";
  const std::string plain = "REEL  Reel name  second\n";
  EXPECT_EQ(runOnTerminal({"show", clip}).out, coloured);
  EXPECT_EQ(run({"show", clip}).out, plain);
  EXPECT_EQ(run({"show", clip, "--color", "always"}).out, coloured);
  EXPECT_EQ(runOnTerminal({"show", clip, "--color", "never"}).out, plain);
  EXPECT_EQ(runOnTerminal({"show", clip}, {"NO_COLOR=1"}).out, plain);
  EXPECT_EQ(runOnTerminal({"show", clip}, {"NO_COLOR="}).out, coloured);
  EXPECT_EQ(runOnTerminal({"show", clip}, {"TERM=dumb"}).out, plain);
  EXPECT_EQ(runOnTerminal({"show", clip, "--color", "always"}, {"NO_COLOR=1"}).out, coloured);
}

TEST(Command, ColoursTheSeverityOfMessages) {
  EXPECT_EQ(runOnTerminal({"show", "missing"}).out,
            "oxmv: \x1B[31merror\x1B[0m: missing: No such file or directory (missing)\n");
}

TEST(Command, NeverColoursJson) {
  EXPECT_EQ(runOnTerminal({"show", clip, "--json", "--color", "always"}).out,
            run({"show", clip, "--json"}).out);
  EXPECT_EQ(runOnTerminal({"dump", clip, "--json"}).out, run({"dump", clip, "--json"}).out);
  EXPECT_EQ(runOnTerminal({"show", clip, "--csv", "--columns", "REEL"}).out,
            run({"show", clip, "--csv", "--columns", "REEL"}).out);
}

TEST(Command, KeepsTheOrderOfResultsAndMessagesOnATerminal) {
  const Outcome outcome =
      runOnTerminal({"show", "--color", "never", data + "white-balance-of-three-is-ignored.bin",
                     "missing", clip});
  const std::string odd = data + "white-balance-of-three-is-ignored.bin";
  EXPECT_EQ(outcome.out, odd + "\nREEL  Reel name  A1\n" + "oxmv: warning: " + odd +
                             ": byte 0: WBAL size 12: ignored, needs 16 (wrong-size)\n" +
                             "oxmv: error: missing: No such file or directory (missing)\n\n" +
                             clip + "\nREEL  Reel name  second\n");
  EXPECT_EQ(outcome.exitCode, 3);
}

TEST(Command, SurvivesBeingCalledWithoutEvenItsName) {
  const Outcome outcome = runShell("exec 2>&1; \"$OXMV\" ''");
  EXPECT_EQ(outcome.exitCode, 2);
  EXPECT_EQ(outcome.out, "oxmv: error: no verb \"\"; oxmv help lists them (unknown-verb)\n");
}

}  // namespace
}  // namespace oxmv::cli::test
