#include <filesystem>
#include <string>

#include <gtest/gtest.h>

#include "oxmv/values/myGUID.h"
#include "tests/cli/CommandRunner.h"
#include "tests/cli/TemporaryDatabase.h"
#include "tests/cli/UserFolders.h"
#include "tests/support/StreamBuilder.h"
#include "tests/support/WideLong.h"

namespace oxmv::cli::test {
namespace {

using oxmv::test::Bytes;
using oxmv::test::guidImage;
using oxmv::test::StreamBuilder;

const std::string guid = "0A1B2C3D-4E5F-0607-0809-AABBCCDDEE0F";
const std::string zeroGuid = "00000000-0000-0000-0000-000000000000";

Bytes reel(const std::string& name) { return StreamBuilder().record("REEL", 'c', name).bytes(); }

// A clip whose GUID record says 04030201-0605-0807-090A-0B0C0D0E0F10.
Bytes withGuidRecord() {
  const std::string image = guidImage("\1\2\3\4", "\5\6\7\x08\x09\x0A\x0B\x0C\x0D\x0E\x0F\x10");
  return StreamBuilder().record("GUID", 'G', image).record("REEL", 'c', "x").bytes();
}
const std::string recordGuid = "04030201-0605-0807-090A-0B0C0D0E0F10";

void expectUsageError(const Outcome& outcome, const std::string& message) {
  EXPECT_EQ(outcome.exitCode, 2);
  EXPECT_EQ(outcome.out, "");
  EXPECT_EQ(outcome.err, "oxmv: error: " + message + "\n");
}

TEST(ClipNames, GuidIsTheCombinedFileInEitherCase) {
  const TemporaryDatabase database;
  database.put(guid + ".colr", reel("A001"));
  EXPECT_EQ(database.run({"get", guid, "REEL"}).out, "A001\n");
  EXPECT_EQ(database.run({"get", "0a1b2c3d-4e5f-0607-0809-aabbccddee0f", "REEL"}).out, "A001\n");
}

TEST(ClipNames, GuidWithASlashIsTheFileOfAnEye) {
  const TemporaryDatabase database;
  database.put(guid + ".col1", reel("L"));
  database.put(guid + ".col2", reel("R"));
  database.put(guid + ".col10", reel("9"));
  for (const std::string eye : {"left", "0", "00"})
    EXPECT_EQ(database.run({"get", guid + "/" + eye, "REEL"}).out, "L\n") << eye;
  for (const std::string eye : {"right", "1"})
    EXPECT_EQ(database.run({"get", guid + "/" + eye, "REEL"}).out, "R\n") << eye;
  EXPECT_EQ(database.run({"get", guid + "/9", "REEL"}).out, "9\n");
}

TEST(ClipNames, RefuseWhatIsNoEye) {
  const TemporaryDatabase database;
  for (const std::string eye : {"Left", "", "-1", "+1", "1.0", "0x1", " 1", "1/", "2147483647",
                                "18446744073709551616", "left/.."})
    expectUsageError(database.run({"show", guid + "/" + eye}),
                     guid +
                         "/ takes left, right, or the index of an eye (0 left, 1 right), not \"" +
                         eye + "\" (bad-eye)");
  EXPECT_EQ(database.run({"show", guid + "/2147483646"}).exitCode, 3);
}

TEST(ClipNames, PathThatLooksLikeAGuidIsWrittenWithItsFolder) {
  const TemporaryDatabase database;
  database.put(guid, reel("file"));
  database.put(guid + ".colr", reel("clip"));
  const std::string inFolder = "cd " + database.folder().string() + " && \"$OXMV\" get --db . ";
  EXPECT_EQ(runShell(inFolder + "./" + guid + " REEL").out, "file\n");
  EXPECT_EQ(runShell(inFolder + guid + " REEL").out, "clip\n");
  EXPECT_EQ(runShell(inFolder + guid + ".colr REEL").out, "clip\n");
}

TEST(ClipNames, WhatIsAlmostAGuidIsAFile) {
  const TemporaryDatabase database;
  for (const std::string& name : {guid + "0", guid.substr(1), "{" + guid + "}", guid + ".colr"})
    EXPECT_EQ(database.run({"show", name}).err,
              "oxmv: error: " + name + ": No such file or directory (missing)\n");
}

TEST(ClipNames, CombinedClipKeepsTheGuidThatWasAskedFor) {
  const TemporaryDatabase database;
  database.put(guid + ".colr", withGuidRecord());
  const Outcome outcome = database.run({"show", "--ndjson", guid});
  EXPECT_NE(outcome.out.find("\"file\":\"" + guid + "\",\"guid\":\"" + guid + "\""),
            std::string::npos)
      << outcome.out;
}

TEST(ClipNames, KeepsTheGuidRecordOfAnEye) {
  const TemporaryDatabase database;
  database.put(guid + ".col1", withGuidRecord());
  database.put(guid + ".col2", reel("x"));
  const std::string left = database.run({"show", "--ndjson", guid + "/left"}).out;
  EXPECT_NE(left.find("\"guid\":\"" + recordGuid + "\""), std::string::npos) << left;
  const std::string right = database.run({"show", "--ndjson", guid + "/right"}).out;
  EXPECT_NE(right.find("\"guid\":\"" + guid + "\""), std::string::npos) << right;
}

TEST(ClipNames, FileHasTheGuidOfItsRecordOrNone) {
  const TemporaryDatabase database;
  database.put("with.colr", withGuidRecord());
  database.put("without.colr", reel("x"));
  const std::string with = database.run({"show", "--ndjson", database.path("with.colr")}).out;
  EXPECT_NE(with.find("\"guid\":\"" + recordGuid + "\""), std::string::npos) << with;
  const std::string without = database.run({"show", "--ndjson", database.path("without.colr")}).out;
  EXPECT_NE(without.find("\"guid\":\"" + zeroGuid + "\""), std::string::npos) << without;
}

TEST(ClipNames, TableSaysAGuidThatTheNameDoesNotSay) {
  const TemporaryDatabase database;
  database.put(guid + ".colr", reel("x"));
  database.put(guid + ".col1", withGuidRecord());
  EXPECT_EQ(database.run({"show", guid}).out, "REEL  Reel name  x\n");
  EXPECT_TRUE(database.run({"show", guid + "/left"}).out.starts_with("clip GUID " + recordGuid));
}

TEST(ClipNames, StandInListsToo) {
  const TemporaryDatabase database;
  database.put(guid + ".colr", reel("clip"));
  database.put(guid + ".col1", reel("eye"));
  const Outcome outcome = database.run({"show", "--csv", "--columns", "REEL", "--files-from", "-"},
                                       guid + "\n" + guid + "/left\n");
  EXPECT_EQ(outcome.err, "");
  EXPECT_EQ(outcome.out, "file,REEL\n" + guid + ",clip\n" + guid + "/left,eye\n");
  expectUsageError(database.run({"check", "--files-from", "-"}, guid + "/middle\n"),
                   guid +
                       "/ takes left, right, or the index of an eye (0 left, 1 right), not "
                       "\"middle\" (bad-eye)");
}

TEST(ClipNames, AreTakenByDiffDumpAndCheck) {
  const TemporaryDatabase database;
  database.put(guid + ".colr", reel("A001"));
  database.put(guid + ".col1", reel("A002"));
  const Outcome differ = database.run({"diff", guid, guid + "/left"});
  EXPECT_EQ(differ.exitCode, 1);
  EXPECT_EQ(differ.out, "~ REEL: A001 -> A002\n");
  EXPECT_EQ(database.run({"dump", guid}).out,
            database.run({"dump", database.path(guid + ".colr")}).out);
  const auto found = linesOf(database.run({"check", guid, guid + "/left"}).out);
  ASSERT_EQ(found.size(), 2u);
  EXPECT_TRUE(found[0].starts_with(guid + ": byte 0: REEL")) << found[0];
  EXPECT_TRUE(found[1].starts_with(guid + "/left: byte 0: REEL")) << found[1];
}

TEST(ClipNames, SetEditsWhereTheClipIs) {
  const TemporaryDatabase database;
  database.put(guid + ".colr", reel("A001"));
  const Outcome outcome = database.run({"set", "-v", "--backup", guid, "REEL=A002"});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_EQ(outcome.err, "oxmv: note: " + guid + ": REEL: A001 -> A002\n" + "oxmv: note: " + guid +
                             ": the old file is " + database.path(guid + ".colr~") + "\n" +
                             "oxmv: note: " + guid + ": got 16 bytes\n");
  EXPECT_EQ(database.run({"get", guid, "REEL"}).out, "A002\n");
}

TEST(ClipNames, SetMakesAClipInTheDatabase) {
  const TemporaryDatabase database;
  const Outcome without = database.run({"set", guid, "REEL=A001"});
  EXPECT_EQ(without.exitCode, 3);
  EXPECT_EQ(without.err,
            "oxmv: error: " + guid + ": No such file or directory; --create makes it (missing)\n");
  EXPECT_EQ(database.run({"set", "--create", guid, "REEL=A001"}).exitCode, 0);
  EXPECT_EQ(readFile(database.folder() / (guid + ".colr")).substr(8, 4), "A001");
  EXPECT_EQ(database.run({"set", "--create", guid + "/right", "REEL=A001"}).exitCode, 0);
  EXPECT_TRUE(std::filesystem::exists(database.folder() / (guid + ".col2")));
}

TEST(ClipNames, SetSaysHowTheFolderIsMade) {
  const TemporaryDatabase database;
  std::filesystem::remove(database.folder());
  const Outcome outcome = database.run({"set", "--create", guid, "REEL=A001"});
  EXPECT_EQ(outcome.exitCode, 3);
  EXPECT_EQ(outcome.err, "oxmv: error: " + guid +
                             ": No such file or directory; its folder is not there: oxmv db init "
                             "makes it (write-failed)\n");
  EXPECT_FALSE(std::filesystem::exists(database.folder()));
}

TEST(ClipNames, UnsetKeepsNoFileOfAnEyeWithoutTags) {
  const TemporaryDatabase database;
  database.put(guid + ".col1", reel("L"));
  database.put(guid + ".colr", reel("C"));
  EXPECT_EQ(database.run({"unset", "--dry-run", guid + "/left", "REEL"}).exitCode, 0);
  EXPECT_TRUE(std::filesystem::exists(database.folder() / (guid + ".col1")));
  EXPECT_EQ(database.run({"unset", guid + "/left", "REEL"}).exitCode, 0);
  EXPECT_FALSE(std::filesystem::exists(database.folder() / (guid + ".col1")));
  EXPECT_EQ(database.run({"unset", guid, "REEL"}).exitCode, 0);
  EXPECT_EQ(readFile(database.folder() / (guid + ".colr")), "");
  EXPECT_TRUE(std::filesystem::exists(database.folder() / (guid + ".colr")));
}

TEST(ClipNames, EncodeWritesWhereTheClipIs) {
  const TemporaryDatabase database;
  EXPECT_EQ(database.run({"encode", "-", "-o", guid}, "{\"REEL\":\"A001\"}").exitCode, 0);
  EXPECT_EQ(database.run({"get", guid, "REEL"}).out, "A001\n");
  EXPECT_EQ(database.run({"encode", "-", "-o", guid + "/left"}, "{\"REEL\":\"L\"}").exitCode, 0);
  EXPECT_EQ(database.run({"get", guid + "/left", "REEL"}).out, "L\n");
}

TEST(ClipNames, EncodeKeepsNoFileOfAnEyeWithoutTags) {
  const TemporaryDatabase database;
  database.put(guid + ".col1", reel("L"));
  for (int i = 0; i < 2; ++i) {
    EXPECT_EQ(database.run({"encode", "-", "-o", guid + "/left", "--allow", "short-stream"}, "{}")
                  .exitCode,
              0);
    EXPECT_FALSE(std::filesystem::exists(database.folder() / (guid + ".col1")));
  }
}

// A user whose override folder is the folders' root.
class OverrideFolder : public testing::Test {
 protected:
  OverrideFolder() { user.setPreferences("OverridePath = \"" + user.root().string() + "\"\n"); }

  void putLast(const std::string& stream) {
    writeFile(
        user.root() / "last",
        guidImage("\x3D\x2C\x1B\x0A", "\x5F\x4E\x07\x06\x08\x09\xAA\xBB\xCC\xDD\xEE\x0F") + stream);
  }

  const UserFolders user;
};

TEST_F(OverrideFolder, HasTheOverrideFile) {
  writeFile(user.root() / "override.colr", reel("A001"));
  EXPECT_EQ(user.run({"get", "@override", "REEL"}).out, "A001\n");
  EXPECT_EQ(user.run({"set", "@override", "REEL=A002"}).exitCode, 0);
  EXPECT_EQ(user.run({"show", "@override"}).out, "REEL  Reel name  A002\n");
  EXPECT_EQ(user.run({"unset", "@override", "REEL"}).exitCode, 0);
  EXPECT_EQ(readFile(user.root() / "override.colr"), "");
  EXPECT_TRUE(std::filesystem::exists(user.root() / "override.colr"));
}

TEST_F(OverrideFolder, GetsANewOverrideFile) {
  EXPECT_EQ(user.run({"encode", "-", "-o", "@override"}, "{\"REEL\":\"A001\"}").exitCode, 0);
  EXPECT_EQ(user.run({"get", "@override", "REEL"}).out, "A001\n");
}

TEST_F(OverrideFolder, IsSaidHowToMake) {
  user.setPreferences("OverridePath = \"" + (user.root() / "missing").string() + "\"\n");
  const Outcome outcome = user.run({"set", "--create", "@override", "REEL=A001"});
  EXPECT_EQ(outcome.exitCode, 3);
  EXPECT_EQ(outcome.err,
            "oxmv: error: @override: No such file or directory; its folder is not there: oxmv db "
            "init makes it (write-failed)\n");
  const std::string clips = (user.root() / "clips").string();
  EXPECT_EQ(user.run({"prefs", "set", "LUTsPath", clips}).exitCode, 0);
  EXPECT_EQ(user.run({"db", "init"}).out, clips + "/db  clip database\n" +
                                              (user.root() / "missing").string() +
                                              "  folder of the override file\n");
  EXPECT_EQ(user.run({"set", "--create", "@override", "REEL=A001"}).exitCode, 0);
}

TEST_F(OverrideFolder, IsKeptAsAPreferenceWhenItIsFirstAskedFor) {
  user.setPreferences("");
  EXPECT_EQ(user.run({"set", "--dry-run", "--create", "@override", "REEL=A001"}).exitCode, 0);
  EXPECT_EQ(readFile(user.preferences()), "");
  EXPECT_EQ(user.run({"show", "@override"}).exitCode, 3);
  EXPECT_EQ(readFile(user.preferences()),
            "OverridePath = \"/Library/Application Support/Ombrix\"\n");
}

TEST_F(OverrideFolder, HasTheLastFile) {
  putLast(readFile(OXMV_SOURCE_DIR "/examples/eye-left.col1"));
  EXPECT_EQ(user.run({"show", "@last"}).out,
            "clip GUID " + guid +
                "\nTIMC  Timecode   01:02:03:04\nREEL  Reel name  A001_C003L\nHOFF             "
                "0.01\n");
  EXPECT_EQ(user.run({"check", "@last"}).exitCode, 0);
  const std::string dump = user.run({"dump", "@last"}).out;
  const std::string headSize = std::to_string(sizeof(myGUID));
  const std::string head = headSize + " bytes before the stream: clip GUID " + guid + "\n";
  EXPECT_EQ(dump, head + run({"dump", OXMV_SOURCE_DIR "/examples/eye-left.col1"}).out);
  const std::string json = user.run({"dump", "--json", "@last"}).out;
  EXPECT_NE(json.find(",\"head\":" + headSize + ",\"guid\":\"" + guid + "\",\"records\":["),
            std::string::npos)
      << json;
}

TEST_F(OverrideFolder, KeepsTheGuidRecordOfTheLastStream) {
  const Bytes stream = withGuidRecord();
  putLast(std::string(stream.begin(), stream.end()));
  EXPECT_TRUE(user.run({"show", "@last"}).out.starts_with("clip GUID " + recordGuid));
}

TEST_F(OverrideFolder, LastStreamMayBeShort) {
  putLast("");
  const Outcome empty = user.run({"show", "@last"});
  EXPECT_EQ(empty.exitCode, 0);
  EXPECT_EQ(empty.err, "");
  EXPECT_EQ(empty.out, "clip GUID " + guid + "\nno tags\n");
  EXPECT_EQ(user.run({"check", "@last"}).out, "");
  putLast(std::string("TAKE\1\0\0B\7\0\0", 11));  // no stream elsewhere
  EXPECT_EQ(user.run({"get", "@last", "TAKE"}).out, "7\n");
}

TEST_F(OverrideFolder, LastFileNeedsItsGuid) {
  const std::size_t tooFew = sizeof(myGUID) - 1;
  writeFile(user.root() / "last", std::string(tooFew, 'x'));
  const Outcome outcome = user.run({"show", "@last"});
  EXPECT_EQ(outcome.exitCode, 3);
  EXPECT_EQ(outcome.err, "oxmv: error: @last: " + std::to_string(tooFew) +
                             " bytes are too few for the GUID that it begins with (too-short)\n");
  std::filesystem::remove(user.root() / "last");
  EXPECT_EQ(user.run({"show", "@last"}).err,
            "oxmv: error: @last: No such file or directory (missing)\n");
}

TEST(ClipNames, LastIsForReadingOnly) {
  const std::string message = "@last is for reading; a clip is written by its GUID (read-only)";
  expectUsageError(run({"set", "@last", "REEL=x"}), message);
  expectUsageError(run({"unset", "@last", "REEL"}), message);
  expectUsageError(run({"encode", "-", "-o", "@last"}, "{}"), message);
}

}  // namespace
}  // namespace oxmv::cli::test
