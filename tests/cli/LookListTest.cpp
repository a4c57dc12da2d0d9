#include <filesystem>
#include <string>

#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include "tests/cli/CommandRunner.h"
#include "tests/cli/LookFolder.h"

namespace oxmv::cli::test {
namespace {

namespace fs = std::filesystem;
using Json = nlohmann::json;

// A look-table file of one point, as far as a list reads it.
std::string lookFile(const std::string& name, char version = 2) {
  std::string file = std::string("OXLK") + version + std::string("\0\0\0\x40\0\0\0\x01\0\0\0", 11) +
                     std::string(8, '\0') + name;
  file.resize(64 + 12);
  return file;
}

TEST(LookList, ShowsTheLooksInTheFolder) {
  const LookFolder folder;
  folder.run({"import", "-q", lookData + "Warm-17.xml", lookData + "Night-33.xml",
              lookData + "a-name-of-44-characters-before-its-extension.xml"});
  fs::remove(folder.look("Night-33.xml"));
  const Outcome outcome = folder.run({"list"});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_EQ(outcome.err, "");
  EXPECT_EQ(outcome.out,
            "CRC       VERSION  POINTS  NAME      SOURCE\n"
            "122C1A66  2        33      Night-33  -\n"
            "1E4D9941  2        1       -         -\n"
            "43B0C2CA  2        17      Warm-17   Warm-17.xml\n");
}

TEST(LookList, GivesTheJsonOfScripts) {
  const LookFolder folder;
  folder.run({"import", lookData + "Warm-17.xml"});
  const std::string result =
      R"({"schema":"oxmv.look/1","file":"43B0C2CA.oxlook","crc":"43B0C2CA","version":2,"size":17,)"
      R"("name":"Warm-17","error":null})";
  EXPECT_EQ(folder.run({"list", "--json"}).out, "[\n" + result + "\n]\n");
  EXPECT_EQ(folder.run({"list", "--ndjson"}).out, result + '\n');
}

TEST(LookList, GivesATableForSpreadsheets) {
  const LookFolder folder;
  writeFile(folder.look("0000000A.oxlook"), lookFile("Warm, \"soft\""));
  folder.run({"import", lookData + "Warm-17.xml"});
  EXPECT_EQ(folder.run({"list", "--csv"}).out,
            "file,crc,version,points,name,source\n"
            "0000000A.oxlook,0000000A,2,1,\"Warm, \"\"soft\"\"\",\n"
            "43B0C2CA.oxlook,43B0C2CA,2,17,Warm-17,Warm-17.xml\n");
}

TEST(LookList, MakesNamesUniqueAsHostsDo) {
  const LookFolder folder;
  writeFile(folder.look("00000001.oxlook"), lookFile("Warm"));
  writeFile(folder.look("00000002.oxlook"), lookFile("WARM_1"));
  writeFile(folder.look("00000003.oxlook"), lookFile("warm"));
  writeFile(folder.look("00000004.oxlook"), lookFile("Warm"));
  writeFile(folder.look("00000005.oxlook"), lookFile("Cold"));
  std::string names;
  const Json looks = Json::parse(folder.run({"list", "--json"}).out);
  for (const Json& look : looks) names += look["name"].get<std::string>() + ' ';
  EXPECT_EQ(names, "Warm WARM_1 warm_2 Warm_3 Cold ");
}

TEST(LookList, FilesOfOldVersionsShowTheirFileNames) {
  const LookFolder folder;
  writeFile(folder.look("0000000A.oxlook"), lookFile("Warm", 1));
  writeFile(folder.look("0000000B.oxlook"), "something else");
  EXPECT_EQ(folder.run({"list"}).out,
            "CRC       VERSION  POINTS  NAME             SOURCE\n"
            "0000000A  1        1       0000000A.oxlook  -\n"
            "0000000B  0        -       0000000B.oxlook  -\n");
}

TEST(LookList, NamesFilesThatAreNoLooksAndListsTheOthers) {
  const LookFolder folder;
  folder.run({"import", lookData + "Warm-17.xml"});
  writeFile(folder.look("look.oxlook"), lookFile("Warm"));
  writeFile(folder.look("0000000C.oxlook"), lookFile("Caf\u00E9"));
  fs::create_directory(folder.look("0000000D.oxlook"));
  const Outcome outcome = folder.run({"list"});
  EXPECT_EQ(outcome.exitCode, 3);
  EXPECT_EQ(outcome.out,
            "CRC       VERSION  POINTS  NAME     SOURCE\n"
            "0000000C  2        1       -        -\n"
            "43B0C2CA  2        17      Warm-17  Warm-17.xml\n");
  EXPECT_EQ(outcome.err,
            "oxmv: error: " + folder.look("0000000C.oxlook") +
                ": the name in it is not ASCII: a look without a name (name-not-ascii)\n" +
                "oxmv: error: " + folder.look("0000000D.oxlook") +
                ": Is a directory (not-a-file)\n" + "oxmv: error: " + folder.look("look.oxlook") +
                ": its name does not begin with a CRC: no look (bad-name)\n");
  const Json looks = Json::parse(folder.run({"list", "--json"}).out);
  ASSERT_EQ(looks.size(), 4u);
  EXPECT_EQ(looks[3]["crc"], nullptr);
  EXPECT_EQ(looks[3]["error"]["code"], "bad-name");
}

TEST(LookList, OfAnEmptyFolderIsEmpty) {
  const LookFolder folder;
  EXPECT_EQ(folder.run({"list"}).out, "");
  EXPECT_EQ(folder.run({"list"}).exitCode, 0);
  EXPECT_EQ(folder.run({"list", "--json"}).out, "[]\n");
}

TEST(LookList, WithoutAFolderNamesTheVerbThatMakesIt) {
  const LookFolder folder;
  fs::remove(folder.looks());
  const Outcome outcome = folder.run({"list", "--json"});
  EXPECT_EQ(outcome.exitCode, 3);
  EXPECT_EQ(outcome.out, "[]\n");
  EXPECT_EQ(outcome.err, "oxmv: error: " + folder.looks().string() +
                             ": there is no such look-table folder; oxmv look init makes it"
                             " (missing)\n");
  writeFile(folder.looks(), "");
  EXPECT_EQ(folder.run({"list"}).err,
            "oxmv: error: " + folder.looks().string() + ": is no folder (not-a-folder)\n");
}

TEST(LookList, FindsTheFolderInTheEnvironment) {
  const LookFolder folder;
  folder.run({"import", lookData + "Warm-17.xml"});
  const std::string variable = "OXMV_LOOKS=" + folder.looks().string();
  EXPECT_EQ(runWith({variable}, {"look", "list"}).out, folder.run({"list"}).out);
}

TEST(LookList, HidesWhatWouldDisturbATerminal) {
  const LookFolder folder;
  writeFile(folder.look("0000000A.oxlook"), lookFile("Warm\x1B[2J"));
  EXPECT_NE(folder.run({"list"}).out.find("Warm\\x1B[2J"), std::string::npos);
}

}  // namespace
}  // namespace oxmv::cli::test
