#include <filesystem>
#include <set>
#include <string>

#include <gtest/gtest.h>

#include "tests/cli/CommandRunner.h"
#include "tests/support/TempDir.h"

namespace oxmv::cli::test {
namespace {

namespace fs = std::filesystem;
using oxmv::test::TempDir;

const fs::path examples = fs::path(OXMV_SOURCE_DIR) / "examples";

std::set<std::string> namesIn(const fs::path& folder) {
  std::set<std::string> names;
  for (const auto& entry : fs::directory_iterator(folder)) names.insert(entry.path().filename());
  return names;
}

bool isClip(const fs::path& file) { return file.extension().string().starts_with(".col"); }

TEST(Demo, WritesTheExamplesAndADamagedClip) {
  const TempDir folder;
  const fs::path demo = folder / "some/where";
  const Outcome outcome = run({"demo", demo});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_EQ(outcome.err, "");
  std::set<std::string> expected = namesIn(examples);
  expected.erase("set-white-balance.cpp");  // is for programmers, and no file to try the command on
  for (const std::string& name : expected)
    EXPECT_EQ(readFile(demo / name), readFile(examples / name)) << name;
  expected.insert("damaged.colr");
  EXPECT_EQ(namesIn(demo), expected);
}

TEST(Demo, SaysWhatItWroteAndWhatToTry) {
  const TempDir folder;
  const auto lines = linesOf(run({"demo", folder / "demo"}).out);
  std::size_t files = 0;
  while (files < lines.size() && !lines[files].empty()) ++files;
  EXPECT_EQ(files, namesIn(folder / "demo").size());
  ASSERT_EQ(lines.size(), files + 8);
  EXPECT_EQ(lines[files + 1], "Now try");
  for (std::size_t i = files + 2; i < lines.size(); ++i) {
    ASSERT_TRUE(lines[i].starts_with("  oxmv ")) << lines[i];
    const Outcome outcome = runShell("\"$OXMV\" " + lines[i].substr(7));
    EXPECT_EQ(outcome.exitCode, 0) << lines[i] << outcome.err;
  }
}

TEST(Demo, QuotesOddNamesInWhatToTry) {
  const TempDir folder;
  const auto lines = linesOf(run({"demo", folder / "it's here"}).out);
  EXPECT_EQ(runShell("\"$OXMV\" " + lines.back().substr(7)).exitCode, 0) << lines.back();
}

TEST(Demo, DamagesTheDamagedClip) {
  const TempDir folder;
  ASSERT_EQ(run({"demo", folder.path()}).exitCode, 0);
  for (const std::string& name : namesIn(folder.path())) {
    if (!isClip(name)) continue;
    EXPECT_EQ(run({"check", folder / name}).exitCode, name == "damaged.colr" ? 1 : 0) << name;
  }
  EXPECT_EQ(linesOf(run({"check", folder / "damaged.colr"}).out).size(), 2u);
}

TEST(Demo, OverwritesNothing) {
  const TempDir folder;
  writeFile(folder / "walk.json", "mine");
  const Outcome outcome = run({"demo", folder.path()});
  EXPECT_EQ(outcome.exitCode, 4);
  EXPECT_EQ(outcome.out, "");
  EXPECT_EQ(outcome.err, "oxmv: refused: " + (folder / "walk.json").string() +
                             ": is there already (file-exists); nothing written\n");
  EXPECT_EQ(namesIn(folder.path()), std::set<std::string>{"walk.json"});
  EXPECT_EQ(readFile(folder / "walk.json"), "mine");
}

TEST(Demo, WritesNothingOnADryRun) {
  const TempDir folder;
  const Outcome outcome = run({"demo", "--dry-run", folder / "demo"});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_NE(outcome.out.find("walk.colr"), std::string::npos);
  EXPECT_FALSE(fs::exists(folder / "demo"));
}

TEST(Demo, NamesAFolderThatCannotBeMade) {
  const TempDir folder;
  writeFile(folder / "file", "");
  const Outcome outcome = run({"demo", folder / "file"});
  EXPECT_EQ(outcome.exitCode, 3);
  EXPECT_EQ(outcome.out, "");
  EXPECT_EQ(outcome.err,
            "oxmv: error: " + (folder / "file").string() + ": Not a directory (write-failed)\n");
}

TEST(Examples, AreWhatTheirTagsEncodeTo) {
  for (const std::string& name : namesIn(examples)) {
    if (!isClip(name)) continue;
    fs::path tags = examples / name;
    tags.replace_extension(".json");
    const Outcome outcome = run({"encode", tags, "-o", "-"});
    EXPECT_EQ(outcome.exitCode, 0) << outcome.err;
    EXPECT_EQ(outcome.out, readFile(examples / name)) << name;
  }
}

TEST(Examples, AreTheSamplesOfTheSameName) {
  for (const char* name : {"typical-clip.colr", "eye-left.col1", "eye-right.col2"}) {
    EXPECT_EQ(readFile(examples / name), readFile(fs::path(OXMV_TEST_DATA) / "streams" / name));
  }
}

}  // namespace
}  // namespace oxmv::cli::test
