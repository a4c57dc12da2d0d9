// `db show`, `db path`, `db init`, and what the family has in common.

#include <filesystem>
#include <string>

#include <gtest/gtest.h>

#include "tests/cli/CommandRunner.h"
#include "tests/cli/TemporaryDatabase.h"
#include "tests/support/Files.h"
#include "tests/support/StreamBuilder.h"
#include "tests/support/TempDir.h"

namespace oxmv::cli::test {
namespace {

using oxmv::test::Bytes;
using oxmv::test::namesIn;
using oxmv::test::StreamBuilder;
using oxmv::test::TempDir;

const std::string guid = "0A1B2C3D-4E5F-0607-0809-AABBCCDDEE0F";

Bytes reel(const std::string& name) { return StreamBuilder().record("REEL", 'c', name).bytes(); }

TEST(Db, HelpOfEachVerbBeginsWithExamples) {
  const Outcome family = run({"help", "db"});
  for (const std::string verb : {"list", "show", "check", "path", "init"}) {
    const Outcome help = run({"help", "db", verb});
    EXPECT_EQ(help.exitCode, 0);
    EXPECT_TRUE(help.out.starts_with("Examples\n  oxmv db " + verb)) << help.out;
    EXPECT_EQ(run({"db", verb, "--help"}).out, help.out);
    EXPECT_NE(family.out.find("\n  db " + verb), std::string::npos);
  }
  EXPECT_EQ(run({"db", "--help"}).out, family.out);
}

TEST(Db, NeedsAVerb) {
  const Outcome none = run({"db"});
  EXPECT_EQ(none.exitCode, 2);
  EXPECT_EQ(
      none.err,
      "oxmv: error: db needs one of list, show, check, path, init behind it (missing-verb)\n");
  const Outcome mistyped = run({"db", "lsit"});
  EXPECT_EQ(mistyped.exitCode, 2);
  EXPECT_EQ(mistyped.err, "oxmv: error: no verb \"lsit\"; did you mean list? (unknown-verb)\n");
}

TEST(DbShow, ShowsAllFilesOfTheClip) {
  const TemporaryDatabase database;
  database.put(guid + ".col2", reel("R"));
  database.put(guid + ".colr", reel("C"));
  database.put(guid + ".col1", reel("L"));
  database.put("1A1B2C3D-4E5F-0607-0809-AABBCCDDEE0F.colr", reel("other"));
  const Outcome outcome = database.run({"db", "show", "0a1b2c3d-4e5f-0607-0809-aabbccddee0f"});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_EQ(outcome.err, "");
  EXPECT_EQ(outcome.out, guid + "\nREEL  Reel name  C\n\n" + guid +
                             "/left\nREEL  Reel name  L\n\n" + guid +
                             "/right\nREEL  Reel name  R\n");
}

TEST(DbShow, ShowsAFileThatStandsAloneWithoutHeading) {
  const TemporaryDatabase database;
  database.put(guid + ".col2", reel("R"));
  EXPECT_EQ(database.run({"db", "show", guid}).out, "REEL  Reel name  R\n");
}

TEST(DbShow, GivesJson) {
  const TemporaryDatabase database;
  database.put(guid + ".col1", reel("L"));
  EXPECT_EQ(database.run({"db", "show", "--ndjson", guid}).out,
            "{\"schema\":\"oxmv.show/1\",\"file\":\"" + guid + "/left\",\"guid\":\"" + guid +
                "\",\"tags\":{\"REEL\":\"L\"},\"warnings\":[],\"error\":null}\n");
}

TEST(DbShow, NamesAClipThatIsNotThere) {
  const TemporaryDatabase database;
  const Outcome outcome = database.run({"db", "show", guid});
  EXPECT_EQ(outcome.exitCode, 3);
  EXPECT_EQ(outcome.err, "oxmv: error: " + guid + ": No such file or directory (missing)\n");
}

TEST(DbShow, RefusesWhatIsNoGuid) {
  const TemporaryDatabase database;
  for (const std::string word : {"clip.colr", "-", "@last"}) {
    const Outcome outcome = database.run({"db", "show", word});
    EXPECT_EQ(outcome.exitCode, 2);
    EXPECT_EQ(outcome.err, "oxmv: error: \"" + word +
                               "\" is no GUID; one is 8-4-4-4-12 hexadecimal digits (bad-guid)\n");
  }
}

TEST(DbPath, SaysWhereTheFilesAre) {
  const TemporaryDatabase database;
  EXPECT_EQ(database.run({"db", "path", guid}).out, database.path(guid + ".colr\n"));
  EXPECT_EQ(database.run({"db", "path", guid, "--eye", "0"}).out, database.path(guid + ".col1\n"));
  EXPECT_EQ(database.run({"db", "path", guid, "--eye", "right"}).out,
            database.path(guid + ".col2\n"));
  EXPECT_EQ(database.run({"db", "path", guid + "/7"}).out, database.path(guid + ".col8\n"));
  EXPECT_EQ(run({"db", "path", guid}).out,
            "/Library/Application Support/Ombrix/LUTs/db/" + guid + ".colr\n");
}

TEST(DbPath, TakesTheFolderFromTheEnvironmentUnlessAFlagSaysIt) {
  EXPECT_EQ(runWith({"OXMV_DB=/clips/db/"}, {"db", "path", guid}).out,
            "/clips/db/" + guid + ".colr\n");
  EXPECT_EQ(runWith({"OXMV_DB=/clips"}, {"db", "path", guid, "--db", "/other"}).out,
            "/other/" + guid + ".colr\n");
  EXPECT_EQ(runWith({"OXMV_DB="}, {"db", "path", guid}).out,
            "/Library/Application Support/Ombrix/LUTs/db/" + guid + ".colr\n");
}

TEST(DbPath, RefusesWhatIsNoEye) {
  const Outcome outcome = run({"db", "path", guid, "--eye", "middle"});
  EXPECT_EQ(outcome.exitCode, 2);
  EXPECT_EQ(outcome.err,
            "oxmv: error: --eye takes left, right, or the index of an eye (0 left, 1 right), not "
            "\"middle\" (bad-eye)\n");
  EXPECT_EQ(run({"db", "path", guid + "/left", "--eye", "0"}).exitCode, 2);
}

TEST(DbInit, MakesTheFolderAndThoseAboveIt) {
  const TempDir root;
  const std::string folder = (root / "a/b/db").string();
  const Outcome outcome = run({"db", "init", "--db", folder});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_EQ(outcome.err, "");
  EXPECT_EQ(outcome.out, folder + "  clip database\n");
  EXPECT_TRUE(std::filesystem::is_directory(folder));
  EXPECT_EQ(run({"set", "--create", guid, "REEL=A001", "--db", folder}).exitCode, 0);
}

TEST(DbInit, LeavesAFolderThatIsThere) {
  const TemporaryDatabase database;
  database.put("file", reel("x"));
  const Outcome outcome = database.run({"db", "init", "-v"});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_EQ(outcome.out, "");
  EXPECT_EQ(outcome.err,
            "oxmv: note: " + database.folder().string() + ": the clip database is there\n");
  EXPECT_EQ(namesIn(database.folder()), (std::set<std::string>{"file"}));
}

TEST(DbInit, MakesNothingOnADryRun) {
  const TempDir root;
  const std::string folder = (root / "db").string();
  EXPECT_EQ(run({"db", "init", "-n", "--db", folder}).out, folder + "  clip database\n");
  EXPECT_TRUE(namesIn(root.path()).empty());
}

TEST(DbInit, NamesWhatIsInTheWay) {
  const TempDir root;
  writeFile(root / "file", reel("x"));
  const std::string file = (root / "file").string();
  const Outcome outcome = run({"db", "init", "--db", file});
  EXPECT_EQ(outcome.exitCode, 3);
  EXPECT_EQ(outcome.out, "");
  EXPECT_EQ(outcome.err, "oxmv: error: " + file + ": Not a directory (write-failed)\n");
  const Outcome below = run({"db", "init", "--db", file + "/db"});
  EXPECT_EQ(below.exitCode, 3);
  EXPECT_EQ(below.err, "oxmv: error: " + file + "/db: Not a directory (write-failed)\n");
}

}  // namespace
}  // namespace oxmv::cli::test
