#include <filesystem>
#include <map>
#include <string>

#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include "tests/cli/CommandRunner.h"
#include "tests/cli/UserFolders.h"

namespace oxmv::cli::test {
namespace {

using Json = nlohmann::ordered_json;

class Paths : public testing::Test {
 protected:
  // The places by what they are. The user's preferences come first, and are the ones kept.
  std::map<std::string, Json> places(std::vector<std::string> flags = {}) {
    flags.insert(flags.begin(), {"paths", "--json"});
    const Outcome outcome = user.run(flags);
    EXPECT_EQ(outcome.exitCode, 0);
    EXPECT_EQ(outcome.err, "");
    std::map<std::string, Json> found;
    for (const Json& place : Json::parse(outcome.out)) {
      EXPECT_EQ(place["schema"], "oxmv.paths/1");
      EXPECT_EQ(place["error"], nullptr);
      found.emplace(place["what"], place);
    }
    return found;
  }

  const UserFolders user;
};

TEST_F(Paths, AreBuiltInAtFirstAndNothingIsMade) {
  const Outcome outcome = user.run({"paths"});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_EQ(outcome.err, "");
  const auto lines = linesOf(outcome.out);
  ASSERT_EQ(lines.size(), 9u);
  EXPECT_TRUE(lines[0].starts_with("WHAT             WHERE  ")) << lines[0];
  EXPECT_TRUE(
      lines[1].starts_with("clip database    /Library/Application Support/Ombrix/LUTs/db  "))
      << lines[1];
  EXPECT_TRUE(lines[7].starts_with("preferences      " + user.preferences().string())) << lines[7];
  EXPECT_TRUE(lines[7].ends_with("  of the user                    missing")) << lines[7];
  EXPECT_TRUE(std::filesystem::is_empty(user.root()));
}

TEST_F(Paths, SayWhereTheyComeFrom) {
  user.setPreferences("LUTsPath = \"/mnt/looks\"\nOverridePath = 5\n");
  auto all = places();
  EXPECT_EQ(all["clip database"]["file"], "/mnt/looks/db");
  EXPECT_EQ(all["clip database"]["source"], "preference LUTsPath, built-in");
  EXPECT_EQ(all["combined clips"]["file"], "/mnt/looks/db/GUID.colr");
  EXPECT_EQ(all["combined clips"]["source"], "built-in");
  EXPECT_EQ(all["combined clips"]["state"], nullptr);
  EXPECT_EQ(all["clips of an eye"]["file"], "/mnt/looks/db/GUID.colN");
  EXPECT_EQ(all["override file"]["file"], "/Library/Application Support/Ombrix/override.colr");
  EXPECT_EQ(all["override file"]["source"], "built-in");
  EXPECT_EQ(all["last file"]["file"], "/Library/Application Support/Ombrix/last");
  EXPECT_EQ(all["look tables"]["file"], "/Library/Application Support/Ombrix/LUTs");
  EXPECT_EQ(all["look tables"]["source"], "localized string OXMVLutsPath");
  EXPECT_EQ(all["preferences"]["file"], user.preferences().string());
  EXPECT_EQ(all["preferences"]["state"], "there");
  EXPECT_EQ(readFile(user.preferences()), "LUTsPath = \"/mnt/looks\"\nOverridePath = 5\n");
}

TEST_F(Paths, SayWhatWasNamedForThisRun) {
  auto all = places({"--db", "/clips/db", "--looks", "/looks"});
  EXPECT_EQ(all["clip database"]["file"], "/clips/db");
  EXPECT_EQ(all["clip database"]["source"], "--db");
  EXPECT_EQ(all["combined clips"]["file"], "/clips/db/GUID.colr");
  EXPECT_EQ(all["look tables"]["file"], "/looks");
  EXPECT_EQ(all["look tables"]["source"], "--looks");
  const Outcome outcome = runWith({"OXMV_DB=/a/b", "OXMV_LOOKS=/c"}, {"paths"});
  EXPECT_NE(outcome.out.find("/a/b "), std::string::npos);
  EXPECT_NE(outcome.out.find(" $OXMV_DB "), std::string::npos);
  EXPECT_NE(outcome.out.find(" $OXMV_LOOKS "), std::string::npos);
}

TEST_F(Paths, ClipsStayWhereTheyAreWhenOnlyLooksAreNamed) {
  auto all = places({"--looks", "/looks"});
  EXPECT_EQ(all["clip database"]["file"], "/Library/Application Support/Ombrix/LUTs/db");
  EXPECT_EQ(all["clip database"]["source"], "built-in");
}

TEST_F(Paths, SayWhatIsThere) {
  const std::string root = user.root().string();
  user.setPreferences("LUTsPath = \"" + root + "\"\nOverridePath = \"" + root + "\"\n");
  writeFile(user.root() / "db", std::string_view("a file"));
  writeFile(user.root() / "last", std::string_view("x"));
  std::filesystem::create_directory(user.root() / "override.colr");
  auto all = places();
  EXPECT_EQ(all["clip database"]["state"], "not a folder");
  EXPECT_EQ(all["last file"]["state"], "there");
  EXPECT_EQ(all["override file"]["state"], "not a file");
}

TEST_F(Paths, SayWhatIsWrongWithPreferences) {
  user.setPreferences("= 1\n");
  const std::string state = places()["preferences"]["state"];
  EXPECT_TRUE(state.starts_with("line 1: ")) << state;
}

}  // namespace
}  // namespace oxmv::cli::test
