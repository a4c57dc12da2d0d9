#include <filesystem>
#include <string>

#include <gtest/gtest.h>

#include "tests/cli/CommandRunner.h"
#include "tests/cli/UserFolders.h"

namespace oxmv::cli::test {
namespace {

class Prefs : public testing::Test {
 protected:
  // The command succeeds, and says nothing.
  std::string shown(const std::vector<std::string>& arguments) {
    const Outcome outcome = user.run(arguments);
    EXPECT_EQ(outcome.exitCode, 0);
    EXPECT_EQ(outcome.err, "");
    return outcome.out;
  }
  std::string content() const { return readFile(user.preferences()); }

  const UserFolders user;
  const std::string file = user.preferences().string();
  const std::string systemFile = user.systemPreferences().string();
};

void expectUsageError(const Outcome& outcome, const std::string& message) {
  EXPECT_EQ(outcome.exitCode, 2);
  EXPECT_EQ(outcome.out, "");
  EXPECT_EQ(outcome.err, "oxmv: error: " + message + "\n");
}

TEST_F(Prefs, AreWhatIsBuiltInAtFirst) {
  EXPECT_EQ(shown({"prefs"}),
            "KEY            VALUE                                     FROM\n"
            "OverridePath   /Library/Application Support/Ombrix       built-in\n"
            "LUTsPath       /Library/Application Support/Ombrix/LUTs  built-in\n"
            "CurrentDBPath  db                                        built-in\n");
  EXPECT_FALSE(std::filesystem::exists(user.preferences()));
}

TEST_F(Prefs, SayWhichFileSetsThem) {
  user.setPreferences("LUTsPath = \"/mnt/looks\"\n");
  user.setSystemPreferences("LUTsPath = \"/all\"\nCurrentDBPath = \"clips\"\n");
  EXPECT_EQ(shown({"prefs"}),
            "KEY            VALUE                                FROM\n"
            "OverridePath   /Library/Application Support/Ombrix  built-in\n"
            "LUTsPath       /mnt/looks                           " +
                file + "\n" + "CurrentDBPath  clips                                " + systemFile +
                "\n");
}

TEST_F(Prefs, SayWhatIsOfTheWrongKind) {
  user.setPreferences("LUTsPath = [\"/a\"]\nCurrentDBPath = 5\n");
  const auto lines = linesOf(shown({"prefs"}));
  ASSERT_EQ(lines.size(), 4u);
  EXPECT_TRUE(lines[2].ends_with("  built-in: array 1 element in " + file + " is no text"))
      << lines[2];
  EXPECT_TRUE(lines[3].ends_with("  built-in: integer 5 in " + file + " is no text")) << lines[3];
  const Outcome get = user.run({"prefs", "get", "CurrentDBPath"});
  EXPECT_EQ(get.exitCode, 0);
  EXPECT_EQ(get.out, "5\n");
  EXPECT_EQ(get.err, "oxmv: warning: CurrentDBPath: integer 5 in " + file +
                         " is no text; what is built in is used (not-text)\n");
}

TEST_F(Prefs, GiveJson) {
  user.setPreferences("LUTsPath = \"/mnt/looks\"\nCurrentDBPath = 5\n");
  const std::string folder = "\"/Library/Application Support/Ombrix\"";
  EXPECT_EQ(shown({"prefs", "--ndjson"}),
            "{\"schema\":\"oxmv.prefs/1\",\"file\":null,\"key\":\"OverridePath\",\"stored\":null,"
            "\"used\":" +
                folder + ",\"source\":\"built-in\",\"error\":null}\n" +
                "{\"schema\":\"oxmv.prefs/1\",\"file\":\"" + file +
                "\",\"key\":\"LUTsPath\",\"stored\":\"/mnt/looks\",\"used\":\"/mnt/looks\","
                "\"source\":\"preference\",\"error\":null}\n" +
                "{\"schema\":\"oxmv.prefs/1\",\"file\":\"" + file +
                "\",\"key\":\"CurrentDBPath\",\"stored\":5,\"used\":\"db\",\"source\":\"built-in\","
                "\"error\":null}\n");
}

TEST_F(Prefs, AreSetAndGotAndUnset) {
  EXPECT_EQ(shown({"prefs", "set", "LUTsPath", "/mnt/my looks"}), "");
  EXPECT_EQ(content(), "LUTsPath = \"/mnt/my looks\"\n");
  EXPECT_EQ(shown({"prefs", "get", "LUTsPath"}), "/mnt/my looks\n");
  EXPECT_EQ(shown({"prefs", "unset", "LUTsPath"}), "");
  EXPECT_EQ(content(), "");
  const Outcome absent = user.run({"prefs", "get", "LUTsPath"});
  EXPECT_EQ(absent.exitCode, 1);
  EXPECT_EQ(absent.out, "");
  EXPECT_EQ(absent.err, "oxmv: error: LUTsPath is not set (absent)\n");
}

TEST_F(Prefs, SetTakesEveryTextAsText) {
  for (const std::string text : {"5", "true", "", "with \"quotes\"", "-x", "ö"}) {
    EXPECT_EQ(shown({"prefs", "set", "CurrentDBPath", "--", text}), "");
    EXPECT_EQ(shown({"prefs", "get", "CurrentDBPath"}), text + "\n");
  }
}

TEST_F(Prefs, SetChangesNothingElseInTheFile) {
  user.setPreferences("# mine\nother = 1  # kept\nLUTsPath = 5 # was wrong\n");
  EXPECT_EQ(shown({"prefs", "set", "LUTsPath", "/a"}), "");
  EXPECT_EQ(content(), "# mine\nother = 1  # kept\nLUTsPath = \"/a\" # was wrong\n");
}

TEST_F(Prefs, ReachEveryOtherVerb) {
  EXPECT_EQ(shown({"prefs", "set", "LUTsPath", "/mnt/looks"}), "");
  const std::string guid = "0A1B2C3D-4E5F-0607-0809-AABBCCDDEE0F";
  EXPECT_EQ(shown({"db", "path", guid}), "/mnt/looks/db/" + guid + ".colr\n");
  EXPECT_EQ(shown({"db", "path", guid, "--db", "/x"}), "/x/" + guid + ".colr\n");
}

TEST_F(Prefs, ShowOldAndNewOnADryRun) {
  user.setPreferences("LUTsPath = \"/a\"\n");
  EXPECT_EQ(shown({"prefs", "set", "-n", "LUTsPath", "/b"}), "LUTsPath: /a -> /b\n");
  EXPECT_EQ(shown({"prefs", "set", "-n", "LUTsPath", "/a"}), "");
  EXPECT_EQ(shown({"prefs", "unset", "-n", "LUTsPath"}), "LUTsPath: /a -> (absent)\n");
  EXPECT_EQ(content(), "LUTsPath = \"/a\"\n");
}

TEST_F(Prefs, UnsetSaysWhatIsNotTheUsers) {
  const Outcome absent = user.run({"prefs", "unset", "LUTsPath"});
  EXPECT_EQ(absent.exitCode, 1);
  EXPECT_EQ(absent.err, "oxmv: error: LUTsPath is not set (absent)\n");
  user.setSystemPreferences("LUTsPath = \"/all\"\n");
  const Outcome systems = user.run({"prefs", "unset", "LUTsPath"});
  EXPECT_EQ(systems.exitCode, 1);
  EXPECT_EQ(systems.err, "oxmv: error: LUTsPath is set in " + systemFile +
                             " only, which is not the user's (absent)\n");
  EXPECT_EQ(readFile(user.systemPreferences()), "LUTsPath = \"/all\"\n");
}

TEST_F(Prefs, LeaveADamagedFileAlone) {
  const std::string damaged = "LUTsPath = \"/a\nnot toml";
  user.setPreferences(damaged);
  for (const std::vector<std::string>& words :
       {std::vector<std::string>{"prefs", "set", "LUTsPath", "/b"},
        std::vector<std::string>{"prefs", "unset", "LUTsPath"}}) {
    const Outcome outcome = user.run(words);
    EXPECT_EQ(outcome.exitCode, 3);
    EXPECT_EQ(outcome.err, "oxmv: error: " + file +
                               ": The preferences file cannot be read as TOML; it stays as it is: "
                               "mend it, or move it away (write-failed)\n");
    EXPECT_EQ(content(), damaged);
  }
}

TEST_F(Prefs, NameADamagedFileAndShowWhatIsUsed) {
  user.setPreferences("CurrentDBPath = \"x\"\n= 1\n");
  user.setSystemPreferences("CurrentDBPath = \"all\"\n");
  const Outcome outcome = user.run({"prefs"});
  EXPECT_EQ(outcome.exitCode, 3);
  EXPECT_TRUE(outcome.err.starts_with("oxmv: error: " + file + ": line 2: ")) << outcome.err;
  EXPECT_TRUE(outcome.err.ends_with("; nothing in this file counts (not-toml)\n")) << outcome.err;
  EXPECT_NE(outcome.out.find("CurrentDBPath  all "), std::string::npos) << outcome.out;
}

TEST_F(Prefs, NameAFileThatCannotBeRead) {
  std::filesystem::create_directories(user.preferences());  // a folder in its place
  const Outcome outcome = user.run({"prefs", "get", "LUTsPath"});
  EXPECT_EQ(outcome.exitCode, 3);
  EXPECT_TRUE(outcome.err.starts_with("oxmv: error: " + file +
                                      ": Is a directory; nothing in this "
                                      "file counts (unreadable)\n"))
      << outcome.err;
  EXPECT_EQ(user.run({"prefs", "set", "LUTsPath", "/b"}).exitCode, 3);
}

TEST_F(Prefs, NeedAPlace) {
  const Outcome outcome = runWith({"HOME=", "XDG_CONFIG_HOME="}, {"prefs", "set", "LUTsPath", "x"});
  EXPECT_EQ(outcome.exitCode, 3);
  EXPECT_EQ(outcome.err,
            "oxmv: error: There is no folder for preferences; set HOME or XDG_CONFIG_HOME "
            "(write-failed)\n");
}

TEST_F(Prefs, RefuseTextThatIsNotUtf8) {
  const Outcome outcome = user.run({"prefs", "set", "LUTsPath", "/\xFF"});
  EXPECT_EQ(outcome.exitCode, 4);
  EXPECT_EQ(outcome.err,
            "oxmv: refused: LUTsPath: \"/\\xFF\" is not UTF-8 (not-utf8); nothing written\n");
  EXPECT_FALSE(std::filesystem::exists(user.preferences()));
}

TEST_F(Prefs, RefuseWrongUse) {
  expectUsageError(user.run({"prefs", "get", "LUTPath"}),
                   "no preference \"LUTPath\"; did you mean LUTsPath? (unknown-key)");
  expectUsageError(user.run({"prefs", "set", "Colour", "x"}),
                   "no preference \"Colour\"; there are OverridePath, LUTsPath, CurrentDBPath "
                   "(unknown-key)");
  expectUsageError(user.run({"prefs", "ste", "LUTsPath", "x"}),
                   "prefs does get, set and unset, not \"ste\"; did you mean set? (unknown-verb)");
  expectUsageError(user.run({"prefs", "set", "LUTsPath"}),
                   "prefs set needs KEY VALUE (missing-words)");
  expectUsageError(user.run({"prefs", "get"}), "prefs get needs KEY alone (missing-words)");
  expectUsageError(user.run({"prefs", "get", "LUTsPath", "x"}),
                   "prefs get needs KEY alone (missing-words)");
  expectUsageError(user.run({"prefs", "get", "LUTsPath", "--json"}),
                   "JSON is for the list of preferences (bad-flags)");
}

TEST_F(Prefs, NameTheirFileWhenItIsSet) {
  const Outcome outcome = user.run({"prefs", "set", "-v", "LUTsPath", "/a"});
  EXPECT_EQ(outcome.err, "oxmv: note: " + file + ": LUTsPath is set\n");
  EXPECT_EQ(user.run({"prefs", "set", "-v", "LUTsPath", "/a"}).err,
            "oxmv: note: " + file + ": nothing to change\n");
}

}  // namespace
}  // namespace oxmv::cli::test
