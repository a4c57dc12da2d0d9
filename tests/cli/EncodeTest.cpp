#include <set>
#include <string>

#include <gtest/gtest.h>

#include "tests/cli/CommandRunner.h"
#include "tests/support/TempDir.h"
#include "tests/support/TestData.h"

namespace oxmv::cli::test {
namespace {

using oxmv::test::Bytes;
using oxmv::test::TempDir;

const std::string data = OXMV_TEST_DATA "/encodings/";

std::string sample(const std::string& name) {
  const Bytes bytes = oxmv::test::testData("encodings/" + name);
  return {bytes.begin(), bytes.end()};
}

std::vector<std::string> samples() { return oxmv::test::testDataNames("encodings", ".json"); }

// Of the JSON on standard input.
Outcome encode(const std::string& json, const std::vector<std::string>& flags = {}) {
  std::vector<std::string> arguments = {"encode", "-", "-o", "-"};
  arguments.insert(arguments.end(), flags.begin(), flags.end());
  return run(arguments, json);
}

TEST(Encode, MakesAClip) {
  const TempDir folder;
  const Outcome outcome = run({"encode", data + "typical-clip.json", "-o", folder / "made.colr"});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_EQ(outcome.out, "");
  EXPECT_EQ(outcome.err, "");
  EXPECT_EQ(readFile(folder / "made.colr"), sample("typical-clip.exact.bin"));
}

TEST(Encode, WritesToStandardOutput) {
  EXPECT_EQ(run({"encode", data + "typical-clip.json", "--output=-"}).out,
            sample("typical-clip.exact.bin"));
  EXPECT_EQ(encode(sample("typical-clip.json")).out, sample("typical-clip.exact.bin"));
}

TEST(Encode, RefusesToWriteToATerminal) {
  const Outcome outcome = runOnTerminal({"encode", data + "typical-clip.json", "-o", "-"});
  EXPECT_EQ(outcome.exitCode, 4);
  EXPECT_EQ(
      outcome.out,
      "oxmv: \x1B[31mrefused\x1B[0m: standard output: a clip is binary, and this is a terminal"
      " (binary-to-terminal)\n");
}

// What each of the samples loses, however it is encoded.
TEST(Encode, GivesTheBytesOfEverySampleInBothLayouts) {
  for (const std::string& name : samples()) {
    for (const std::string layout : {"exact", "readable"}) {
      std::vector<std::string> arguments = {
          "encode", data + name + ".json", "-q", "-o", "-", "--layout", layout};
      for (const char* code :
           {"bad-key", "int-array", "int-range", "list-count", "list-empty", "list-pads",
            "data-unaligned", "pair-added", "reg-text", "name-grows", "text-long", "text-nonascii",
            "unknown-tag", "wrong-kind", "short-stream", "text-empty", "empty-nested",
            "not-read-back", "float-precision"}) {
        arguments.insert(arguments.end(), {"--allow", code});
      }
      const Outcome outcome = run(arguments);
      EXPECT_EQ(outcome.exitCode, 0) << name << outcome.err;
      EXPECT_EQ(outcome.out, sample(name + "." + layout + ".bin")) << name << layout;
    }
  }
}

TEST(Encode, RefusesWhatWouldNotReadBack) {
  const std::set<std::string> faithful = {"reel-of-four-characters", "tag-group",
                                          "timecode-fills-its-payload", "typical-clip"};
  const std::set<std::string> faithfulIfReadable = {"nested-with-odd-raw-data",
                                                    "raw-data-of-five-bytes"};
  const TempDir folder;
  for (const std::string& name : samples()) {
    const bool isFaithful = faithful.contains(name);
    const Outcome exact = run({"encode", data + name + ".json", "-o", folder / name});
    EXPECT_EQ(exact.exitCode, isFaithful ? 0 : 4) << name << exact.err;
    EXPECT_EQ(std::filesystem::exists(folder / name), isFaithful) << name;
    const Outcome readable =
        run({"encode", data + name + ".json", "-o", "-", "--layout", "readable"});
    EXPECT_EQ(readable.exitCode, isFaithful || faithfulIfReadable.contains(name) ? 0 : 4) << name;
  }
}

TEST(Encode, NamesTheLossAndTheWayOut) {
  const TempDir folder;
  writeFile(folder / "tags.json", R"({"REEL":"Café","FREE":{"$data":"0102030405"},"TAKE":1})");
  writeFile(folder / "made.colr", "as it was");
  const std::string file = (folder / "tags.json").string();
  const Outcome outcome = run({"encode", file, "-o", folder / "made.colr"});
  EXPECT_EQ(outcome.exitCode, 4);
  const auto lines = linesOf(outcome.err);
  ASSERT_EQ(lines.size(), 2u) << outcome.err;
  EXPECT_EQ(lines[0], "oxmv: refused: " + file +
                          ": REEL \"Café\" would be written as zeros: only ASCII is stored"
                          " (text-nonascii); nothing written; --allow text-nonascii lets it"
                          " through");
  EXPECT_TRUE(lines[1].ends_with("(data-unaligned); nothing written; --layout readable avoids it"))
      << lines[1];
  EXPECT_EQ(readFile(folder / "made.colr"), "as it was");
}

TEST(Encode, NamesTheTagsNearestToAKeyThatIsNone) {
  const std::string begin = "oxmv: refused: standard input: ";
  const auto lines = linesOf(encode(R"({"RELE":"A","COL1":{"SATU":1.0,"White balance":1}})").err);
  ASSERT_EQ(lines.size(), 2u);
  EXPECT_EQ(lines[0], begin +
                          "RELE is a tag that is never stored; did you mean REEL (Reel name)?"
                          " (unknown-tag); nothing written; --allow unknown-tag lets it through");
  EXPECT_EQ(lines[1],
            begin +
                "COL1/White balance is no tag: a tag has four ASCII characters; did you mean"
                " WBAL (White balance)? (bad-key); nothing written; --allow bad-key lets it"
                " through");
}

TEST(Encode, LetsThroughWhatIsAllowedAndWarns) {
  const Outcome outcome = encode(R"({"REEL":"Café","TAKE":1})", {"--allow", "text-nonascii"});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_EQ(outcome.out, sample("not-ascii.exact.bin"));
  EXPECT_EQ(outcome.err,
            "oxmv: warning: standard input: REEL \"Café\" would be written as zeros: only ASCII is"
            " stored (text-nonascii)\n");
  EXPECT_EQ(encode(R"({"REEL":"Café","TAKE":1})", {"-q", "--allow=text-nonascii"}).err, "");
  EXPECT_EQ(encode(R"({"REEL":"Café","X":1})", {"-q", "--allow", "text-nonascii"}).exitCode, 4);
}

TEST(Encode, SaysOnlySoManyLosses) {
  std::string json = "{\"TAKE\":1";
  for (int i = 10; i < 40; ++i) json += ",\"X" + std::to_string(i) + "\":1";
  const auto lines = linesOf(encode(json + "}").err);
  ASSERT_EQ(lines.size(), 21u);
  EXPECT_EQ(lines.back(), "oxmv: refused: standard input: 10 losses more");
}

TEST(Encode, ShowsKeysWithoutTheirControlCharacters) {
  const Outcome outcome = encode("{\"a\\u001b[31m\":1}");
  EXPECT_EQ(outcome.exitCode, 4);
  EXPECT_NE(outcome.err.find(": a\\x1B[31m "), std::string::npos) << outcome.err;
}

TEST(Encode, MakesAnEmptyStreamOfNoTags) {
  const TempDir folder;
  EXPECT_EQ(run({"encode", "-", "-o", folder / "empty.colr"}, "{}").exitCode, 0);
  EXPECT_EQ(readFile(folder / "empty.colr"), "");
  EXPECT_TRUE(std::filesystem::exists(folder / "empty.colr"));
}

TEST(Encode, NamesLineAndColumnOfWhatIsNoTagJson) {
  const TempDir folder;
  writeFile(folder / "tags.json", "{\"REEL\": \"x\",\n \"REEL\": \"y\"}");
  const std::string file = (folder / "tags.json").string();
  const Outcome outcome = run({"encode", file, "-o", folder / "made.colr"});
  EXPECT_EQ(outcome.exitCode, 3);
  EXPECT_EQ(outcome.err, "oxmv: error: " + file +
                             ": line 2, column 2: member \"REEL\" stands twice (json-duplicate)\n");
  EXPECT_FALSE(std::filesystem::exists(folder / "made.colr"));
}

TEST(Encode, WritesNothingOnADryRun) {
  const TempDir folder;
  const std::string made = (folder / "made.colr").string();
  const Outcome outcome =
      run({"encode", data + "typical-clip.json", "-n", "--verbose", "-o", made});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_EQ(outcome.err, "oxmv: note: " + made + ": would get 1116 bytes\n");
  EXPECT_FALSE(std::filesystem::exists(made));
  EXPECT_EQ(run({"encode", data + "not-ascii.json", "-n", "-o", made}).exitCode, 4);
}

TEST(Encode, NotesWhatItWroteWhenVerbose) {
  const TempDir folder;
  const std::string made = (folder / "made.colr").string();
  EXPECT_EQ(run({"encode", "-v", data + "typical-clip.json", "-o", made}).err,
            "oxmv: note: " + made + ": got 1116 bytes\n");
}

TEST(Encode, NamesAnOutputThatCannotBeWritten) {
  const TempDir folder;
  const std::string made = (folder / "no-folder/made.colr").string();
  const Outcome outcome = run({"encode", data + "typical-clip.json", "-o", made});
  EXPECT_EQ(outcome.exitCode, 3);
  EXPECT_EQ(outcome.err, "oxmv: error: " + made + ": No such file or directory (write-failed)\n");
  EXPECT_EQ(run({"encode", data + "typical-clip.json", "-o", folder.path()}).err,
            "oxmv: error: " + folder.path().string() + ": Is a directory (write-failed)\n");
}

TEST(Encode, NamesAnInputThatIsMissing) {
  const Outcome outcome = run({"encode", "missing.json", "-o", "made.colr"});
  EXPECT_EQ(outcome.exitCode, 3);
  EXPECT_EQ(outcome.err, "oxmv: error: missing.json: No such file or directory (missing)\n");
}

TEST(Encode, RefusesToOverwriteItsInput) {
  const TempDir folder;
  writeFile(folder / "tags.json", "{}");
  std::filesystem::create_symlink(folder / "tags.json", folder / "link");
  const Outcome outcome = run({"encode", folder / "tags.json", "-o", folder / "link"});
  EXPECT_EQ(outcome.exitCode, 2);
  EXPECT_EQ(outcome.err, "oxmv: error: the output would take the place of the input (same-file)\n");
  EXPECT_EQ(readFile(folder / "tags.json"), "{}");
}

TEST(Encode, RefusesWrongUse) {
  const auto errorOf = [](const std::vector<std::string>& arguments) {
    const Outcome outcome = run(arguments);
    EXPECT_EQ(outcome.exitCode, 2);
    return outcome.err;
  };
  EXPECT_EQ(errorOf({"encode", "x.json"}),
            "oxmv: error: encode needs --output OUT; - is standard output (missing-output)\n");
  EXPECT_EQ(errorOf({"encode"}), "oxmv: error: encode needs FILE.json (missing-words)\n");
  EXPECT_EQ(errorOf({"encode", "x.json", "-o", "y", "--layout", "tidy"}),
            "oxmv: error: --layout is exact, readable, not \"tidy\" (bad-value)\n");
  EXPECT_EQ(errorOf({"encode", "x.json", "-o", "y", "--allow", "everything"}),
            "oxmv: error: --allow knows no code \"everything\"; a refusal names it (bad-value)\n");
}

// What the command shows it also takes, with the same bytes in the end.
TEST(Encode, TakesWhatShowGives) {
  const TempDir folder;
  for (const std::string name : {"typical-clip.colr", "eye-left.col1", "control-points.bin",
                                 "raw-data.bin", "not-finite-floats.bin", "dollar-names.bin"}) {
    const std::string clip = OXMV_TEST_DATA "/streams/" + name;
    const std::string json = run({"show", "--ndjson", clip}).out;
    const std::size_t start = json.find("\"tags\":") + 7;
    const std::size_t end = json.rfind(",\"warnings\":");
    const Outcome outcome = encode(json.substr(start, end - start));
    EXPECT_EQ(outcome.exitCode, 0) << outcome.err;
    EXPECT_EQ(outcome.out, readFile(clip)) << name;
  }
}

}  // namespace
}  // namespace oxmv::cli::test
