#include <algorithm>
#include <filesystem>
#include <string>
#include <vector>

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/stat.h>

#include "tests/cli/CommandRunner.h"
#include "tests/support/StillBuilder.h"
#include "tests/support/TempDir.h"

namespace oxmv::cli::test {
namespace {

using oxmv::test::exampleStill;
using oxmv::test::ExifBuilder;
using oxmv::test::StillBuilder;
using oxmv::test::TempDir;

const std::string example = OXMV_SOURCE_DIR "/examples/still.jpg";
const std::string cameras = OXMV_SOURCE_DIR "/oxmv/import/cameras.toml";

// The still on standard input: what was created nowhere has the same tags everywhere.
Outcome still(const oxmv::test::Bytes& content, const std::vector<std::string>& flags = {}) {
  std::vector<std::string> arguments = {"still", "-"};
  arguments.insert(arguments.end(), flags.begin(), flags.end());
  return run(arguments, {reinterpret_cast<const char*>(content.data()), content.size()});
}

const std::string undated =
    "oxmv: warning: standard input: it is not known when it was created; without STIM, SDAT and"
    " TIMC (no-creation-date)\n";
const std::string notStored =
    "oxmv: warning: standard input: the field of view, FOV 87 (W), is not stored: streams have no"
    " tag for it (unknown-tag)\n";

TEST(Still, ShowsItsTagsAsATable) {
  const Outcome outcome = still(exampleStill(), {"--reel", "A001"});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_EQ(outcome.out,
            "TIMB          Timecode Base                30\n"
            "REEL          Reel name                    A001\n"
            "CMDL                                       QX Gamma\n"
            "FOV (+1 NUL)  Field of view, not in clips  87\n"
            "FIRM                                       QX3.01.02.00\n");
  EXPECT_EQ(outcome.err, undated);
}

TEST(Still, ShowsWhenAFileWasCreated) {
  struct statx status = {};
  ASSERT_EQ(::statx(AT_FDCWD, example.c_str(), 0, STATX_BTIME, &status), 0);
  const bool isDated = (status.stx_mask & STATX_BTIME) != 0;
  const Outcome outcome = run({"still", example});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_EQ(outcome.err.find("no-creation-date") == std::string::npos, isDated) << outcome.err;
  for (const char* tag : {"STIM", "SDAT", "TIMC"})
    EXPECT_EQ(outcome.out.find(tag) != std::string::npos, isDated) << tag;
}

TEST(Still, GivesItsTagsAsJson) {
  const std::string result =
      R"({"schema":"oxmv.still/1","file":"-","tags":{"TIMB":30,"CMDL":"QX Gamma","FOV\u0000":[87],)"
      R"("FIRM":"QX3.01.02.00"},"error":null})";
  EXPECT_EQ(still(exampleStill(), {"--json", "-q"}).out, "[\n" + result + "\n]\n");
  EXPECT_EQ(still(exampleStill(), {"--ndjson", "-q"}).out, result + "\n");
}

TEST(Still, AnEmptyReelNameIsNone) {
  EXPECT_EQ(still(exampleStill(), {"--reel", ""}).out.find("REEL"), std::string::npos);
}

TEST(Still, MakesAClip) {
  const TempDir folder;
  const std::string clip = (folder / "clip.colr").string();
  const Outcome outcome = still(exampleStill(), {"--reel", "A001", "-o", clip});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_EQ(outcome.out, "");
  EXPECT_EQ(outcome.err, undated + notStored);
  EXPECT_EQ(run({"get", clip, "TIMB", "REEL", "CMDL", "FIRM"}).out,
            "30\nA001\nQX Gamma\nQX3.01.02.00\n");
  EXPECT_EQ(run({"check", clip}).exitCode, 0);
  EXPECT_EQ(still(exampleStill(), {"--reel", "A001", "-o", "-"}).out, readFile(clip));
}

TEST(Still, GivesJsonBesideTheClip) {
  const TempDir folder;
  const Outcome outcome = still(exampleStill(), {"-q", "--json", "-o", folder / "clip.colr"});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_EQ(outcome.out, still(exampleStill(), {"-q", "--json"}).out);
  EXPECT_TRUE(std::filesystem::exists(folder / "clip.colr"));
}

TEST(Still, SaysInJsonWhyThereIsNoClip) {
  const TempDir folder;
  const Outcome refused =
      still(exampleStill(), {"-q", "--ndjson", "--reel", "Café", "-o", folder / "clip.colr"});
  EXPECT_EQ(refused.exitCode, 4);
  EXPECT_NE(refused.out.find(R"("FIRM":"QX3.01.02.00"},"error":{"code":"text-nonascii","message":)"
                             R"("REEL \"Café\" would be written as zeros: only ASCII is stored;)"
                             R"( nothing written"}})"),
            std::string::npos)
      << refused.out;
  EXPECT_FALSE(std::filesystem::exists(folder / "clip.colr"));

  const std::string nowhere = (folder / "none/clip.colr").string();
  const Outcome failed = still(exampleStill(), {"-q", "--ndjson", "-o", nowhere});
  EXPECT_EQ(failed.exitCode, 3);
  EXPECT_EQ(
      failed.out,
      R"({"schema":"oxmv.still/1","file":"-","tags":{"TIMB":30,"CMDL":"QX Gamma",)"
      R"("FOV\u0000":[87],"FIRM":"QX3.01.02.00"},"error":{"code":"write-failed","message":")" +
          nowhere + ": No such file or directory\"}}\n");
}

TEST(Still, KeepsQuietAboutTheFieldOfViewWhenItMayBeLost) {
  const TempDir folder;
  const std::string clip = (folder / "clip.colr").string();
  EXPECT_EQ(still(exampleStill(), {"-o", clip, "--allow", "unknown-tag"}).err, undated);
  std::filesystem::copy_file(example, folder / "still.jpg");
  const std::string file = (folder / "still.jpg").string();
  // Some file systems do not know when a file was created, which is a warning as well.
  const bool isDated = run({"still", file, "--strict"}).exitCode == 0;
  EXPECT_EQ(run({"still", file, "-q", "--strict", "-o", clip}).exitCode, 1);
  EXPECT_EQ(run({"still", file, "-q", "--strict", "-o", clip, "--allow", "unknown-tag"}).exitCode,
            isDated ? 0 : 1);
}

TEST(Still, ReplacesAFileWholeOrNotAtAll) {
  const TempDir folder;
  const std::string clip = (folder / "clip.colr").string();
  writeFile(clip, "as it was");
  EXPECT_EQ(still(exampleStill(), {"-q", "--reel", "Café", "-o", clip}).exitCode, 4);
  EXPECT_EQ(readFile(clip), "as it was");
  EXPECT_EQ(still(exampleStill(), {"-q", "-o", clip, "-n"}).exitCode, 0);
  EXPECT_EQ(readFile(clip), "as it was");
  EXPECT_EQ(still(exampleStill(), {"-q", "-o", clip}).exitCode, 0);
  EXPECT_EQ(run({"get", clip, "CMDL"}).out, "QX Gamma\n");
}

TEST(Still, RefusesOtherLossesUnlessTheyAreAllowed) {
  const TempDir folder;
  const std::string clip = (folder / "clip.colr").string();
  const Outcome refused = still(exampleStill(), {"-q", "--reel", "Café", "-o", clip});
  EXPECT_EQ(refused.err,
            "oxmv: refused: standard input: REEL \"Café\" would be written as zeros: only ASCII is"
            " stored (text-nonascii); nothing written; --allow text-nonascii lets it through\n");
  EXPECT_EQ(still(exampleStill(), {"-q", "--reel", "Café", "-o", clip, "--allow", "text-nonascii"})
                .exitCode,
            0);
  EXPECT_EQ(run({"get", clip, "CMDL"}).out, "QX Gamma\n");
}

TEST(Still, WarningsCountWhenStrict) { EXPECT_EQ(still(exampleStill(), {"--strict"}).exitCode, 1); }

TEST(Still, NotesTheLineOfTheLogWhenVerbose) {
  const Outcome outcome = still(exampleStill(), {"-v"});
  EXPECT_EQ(outcome.err, "oxmv: note: FOV SET, BABY!!!!!\n" + undated);
  EXPECT_EQ(outcome.out.find("BABY"), std::string::npos);
}

TEST(Still, SaysInWordsThatAFirmwareTextIsTooShort) {
  const auto short3 = StillBuilder().exif(ExifBuilder().software("QX")).bytes();
  const Outcome outcome = still(short3);
  EXPECT_EQ(outcome.exitCode, 3);
  EXPECT_EQ(outcome.out, "");
  EXPECT_EQ(outcome.err,
            "oxmv: error: standard input: the still's Software text has fewer than 3 characters"
            " (software-too-short)\n");
  EXPECT_EQ(
      still(short3, {"--json"}).out,
      "[\n"
      R"({"schema":"oxmv.still/1","file":"-","tags":null,"error":{"code":"software-too-short")"
      R"(,"message":"the still's Software text has fewer than 3 characters"}})"
      "\n]\n");
}

TEST(Still, NamesAFileThatIsNoStill) {
  const TempDir folder;
  writeFile(folder / "text.jpg", "not a picture");
  const std::string text = (folder / "text.jpg").string();
  const Outcome outcome = run({"still", text, "-o", folder / "clip.colr"});
  EXPECT_EQ(outcome.exitCode, 3);
  EXPECT_EQ(outcome.err,
            "oxmv: error: " + text + ": is no JPEG image that can be decoded (not-an-image)\n");
  EXPECT_FALSE(std::filesystem::exists(folder / "clip.colr"));
  EXPECT_EQ(run({"still", folder / "missing.jpg"}).err,
            "oxmv: error: " + (folder / "missing.jpg").string() +
                ": No such file or directory (missing)\n");
  EXPECT_EQ(run({"still", folder.path()}).exitCode, 3);
  EXPECT_EQ(run({"still", "/dev/null"}).exitCode, 3);
}

TEST(Still, RecognisesTheCamerasOfAFile) {
  const TempDir folder;
  std::string tables = readFile(cameras);
  tables.replace(tables.find("QX Gamma"), 8, "QX Omega");
  writeFile(folder / "mine.toml", tables);
  EXPECT_NE(still(exampleStill(), {"--cameras", folder / "mine.toml"}).out.find("QX Omega"),
            std::string::npos);
}

TEST(Still, NamesTheRowOfCamerasThatIsWrong) {
  const TempDir folder;
  std::string tables = readFile(cameras);
  tables.replace(tables.find("QX3.01"), 6, "QX-301");
  writeFile(folder / "mine.toml", tables);
  const std::string mine = (folder / "mine.toml").string();
  const Outcome outcome = still(exampleStill(), {"--cameras", mine});
  EXPECT_EQ(outcome.exitCode, 3);
  EXPECT_EQ(outcome.out, "");
  EXPECT_EQ(outcome.err, "oxmv: error: " + mine +
                             ": long-prefixes, row 1: prefix \"QX-301\" is not like QX3.01"
                             " (bad-cameras)\n");
  const std::string missing = (folder / "missing.toml").string();
  const Outcome unread = still(exampleStill(), {"--json", "--cameras", missing});
  EXPECT_EQ(unread.err, "oxmv: error: " + missing + ": No such file or directory (missing)\n");
  EXPECT_EQ(unread.out,
            "[\n"
            R"({"schema":"oxmv.still/1","file":"-","tags":null,"error":{"code":"bad-cameras",)"
            R"("message":")" +
                missing + ": No such file or directory\"}}\n]\n");
}

TEST(Still, NeverWritesAClipToATerminal) {
  EXPECT_EQ(runOnTerminal({"still", example, "-o", "-"}).exitCode, 4);
}

TEST(Still, RefusesWrongUse) {
  const auto errorOf = [](const std::vector<std::string>& arguments) {
    const Outcome outcome = run(arguments);
    EXPECT_EQ(outcome.exitCode, 2);
    EXPECT_EQ(outcome.out, "");
    return outcome.err;
  };
  EXPECT_EQ(errorOf({"still"}), "oxmv: error: still needs FILE.jpg (missing-words)\n");
  EXPECT_EQ(errorOf({"still", example, example}),
            "oxmv: error: still takes FILE.jpg, not 2 words (surplus-words)\n");
  EXPECT_EQ(errorOf({"still", example, "-n"}),
            "oxmv: error: --dry-run goes with --output (bad-flags)\n");
  EXPECT_EQ(errorOf({"still", example, "--layout", "exact"}),
            "oxmv: error: --layout goes with --output (bad-flags)\n");
  EXPECT_EQ(errorOf({"still", example, "--json", "-o", "-"}),
            "oxmv: error: JSON and the clip cannot both go to standard output (bad-flags)\n");
  EXPECT_EQ(errorOf({"still", "-", "--cameras", "-"}),
            "oxmv: error: standard input can be read only once (standard-input-twice)\n");
}

TEST(Still, NeverTakesThePlaceOfItsInputs) {
  const TempDir folder;
  writeFile(folder / "mine.toml", readFile(cameras));
  EXPECT_EQ(still(exampleStill(), {"--cameras", folder / "mine.toml", "-o", folder / "mine.toml"})
                .exitCode,
            2);
  EXPECT_EQ(readFile(folder / "mine.toml"), readFile(cameras));
  std::filesystem::copy_file(example, folder / "still.jpg");
  std::filesystem::create_symlink("still.jpg", folder / "link.jpg");
  const Outcome outcome = run({"still", folder / "still.jpg", "-o", folder / "link.jpg"});
  EXPECT_EQ(outcome.exitCode, 2);
  EXPECT_EQ(outcome.err, "oxmv: error: the output would take the place of the input (same-file)\n");
  EXPECT_EQ(readFile(folder / "still.jpg"), readFile(example));
}

}  // namespace
}  // namespace oxmv::cli::test
