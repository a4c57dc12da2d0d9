#include <filesystem>
#include <string>

#include <gtest/gtest.h>

#include "tests/cli/CommandRunner.h"
#include "tests/support/TempDir.h"

namespace oxmv::cli::test {
namespace {

namespace fs = std::filesystem;
using oxmv::test::TempDir;

TEST(LookInit, MakesTheFolderAndThoseAboveIt) {
  const TempDir folder;
  const std::string looks = (folder / "a/b").string();
  const Outcome dry = run({"look", "init", "-n", "--looks", looks});
  EXPECT_EQ(dry.out, looks + "  look-table folder\n");
  EXPECT_FALSE(fs::exists(folder / "a"));
  const Outcome outcome = run({"look", "init", "--looks", looks});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_EQ(outcome.out, dry.out);
  EXPECT_EQ(outcome.err, "");
  EXPECT_TRUE(fs::is_directory(looks));
}

TEST(LookInit, LeavesAFolderAloneThatIsThere) {
  const TempDir folder;
  writeFile(folder / "file", "x");
  const Outcome outcome = run({"look", "init", "-v", "--looks", folder.path()});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_EQ(outcome.out, "");
  EXPECT_EQ(outcome.err,
            "oxmv: note: " + folder.path().string() + ": the look-table folder is there\n");
  EXPECT_EQ(readFile(folder / "file"), "x");
}

TEST(LookInit, NamesAFolderThatCannotBeMade) {
  const TempDir folder;
  writeFile(folder / "file", "");
  const std::string looks = (folder / "file/looks").string();
  const Outcome outcome = run({"look", "init", "--looks", looks});
  EXPECT_EQ(outcome.exitCode, 3);
  EXPECT_EQ(outcome.err, "oxmv: error: " + looks + ": Not a directory (write-failed)\n");
}

}  // namespace
}  // namespace oxmv::cli::test
