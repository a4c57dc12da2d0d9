#include <filesystem>
#include <map>
#include <string>

#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include "tests/cli/CommandRunner.h"
#include "tests/cli/LookFolder.h"

namespace oxmv::cli::test {
namespace {

namespace fs = std::filesystem;
using Json = nlohmann::json;

const std::string warm = lut("<size>1</size><a>0000803F0000003F0000803E</a>");
const std::string warmLook = "B5CB6ADA.oxlook";

// The files of a folder by their names.
std::map<std::string, std::string> filesIn(const fs::path& folder) {
  std::map<std::string, std::string> files;
  if (!fs::exists(folder)) return files;
  for (const auto& entry : fs::directory_iterator(folder))
    files[entry.path().filename()] = readFile(entry.path());
  return files;
}

// What the import of each sample answers.
const Json& samples() {
  static const Json index = Json::parse(readFile(lookData + "index.json"));
  return index;
}

std::string path(const std::string& sample) {
  const std::string good = lookData + sample;
  return fs::exists(good) ? good : lookData + "illegal/" + sample;
}

TEST(LookImport, OfTheSamplesWritesTheExpectedFiles) {
  for (const auto& [sample, expected] : samples().items()) {
    const LookFolder folder;
    const Outcome outcome = folder.run({"import", "--json", path(sample)});
    auto files = filesIn(lookData + "expected/" + sample);
    if (expected["copied"]) files[sample] = readFile(path(sample));
    EXPECT_TRUE(filesIn(folder.looks()) == files) << sample;

    const Json result = Json::parse(outcome.out).at(0);
    EXPECT_EQ(result["schema"], "oxmv.look.import/1");
    EXPECT_EQ(result["alert"], expected["alert"]) << sample;
    EXPECT_EQ(result["copied"], expected["copied"]) << sample;
    EXPECT_EQ(outcome.exitCode, expected["result"] == "nothing"   ? 4
                                : sample == "not-well-formed.xml" ? 3
                                                                  : 0);
    EXPECT_EQ(result["error"].is_null(), outcome.exitCode == 0) << sample;
    if (expected["result"] == "nothing") {
      EXPECT_TRUE(result["reference"].is_null()) << sample;
      continue;
    }
    for (const char* key : {"crc", "version", "name"})
      EXPECT_EQ(result["reference"][key], expected[key]) << sample << ' ' << key;
  }
}

TEST(LookImport, ASecondTimeDoesNothingAndSaysSo) {
  for (const auto& [sample, expected] : samples().items()) {
    if (expected["files"].empty()) continue;
    const LookFolder folder;
    folder.run({"import", path(sample)});
    const auto files = filesIn(folder.looks());
    const Outcome outcome = folder.run({"import", "-q", path(sample)});
    EXPECT_EQ(outcome.exitCode, 0);
    EXPECT_EQ(outcome.err, "");
    EXPECT_EQ(outcome.out.find("(written)"), std::string::npos) << outcome.out;
    EXPECT_EQ(linesOf(outcome.out).back(),
              path(sample) + ": nothing to do: every look in it is already there");
    EXPECT_TRUE(filesIn(folder.looks()) == files) << sample;
  }
}

TEST(LookImport, GivesTheJsonOfScripts) {
  const LookFolder folder;
  const std::string sample = lookData + "Warm-17.xml";
  const auto result = [&](const std::string& reference, const std::string& done) {
    return R"({"schema":"oxmv.look.import/1","file":")" + sample + R"(","reference":)" + reference +
           R"(,"alert":null,"copied":)" + done +
           R"(,"tables":[{"size":17,"values":14739,"missing":0,"surplus":0,"malformed":0,)" +
           R"("crc":"43B0C2CA","file":"43B0C2CA.oxlook","written":)" + done + R"(}],"error":null})";
  };
  EXPECT_EQ(folder.run({"import", "--json", sample}).out,
            "[\n" + result(R"({"crc":"43B0C2CA","version":2,"name":"Warm-17"})", "true") + "\n]\n");
  EXPECT_EQ(folder.run({"import", "--ndjson", sample}).out,
            result(R"({"crc":"00000000","version":0,"name":null})", "false") + '\n');
}

TEST(LookImport, SaysWhatItDidForEachTable) {
  const LookFolder folder;
  const std::string two = lookData + "two-tables.xml";
  folder.run({"import", lookData + "too-many-values.xml"});
  const Outcome outcome = folder.run({"import", two});
  EXPECT_EQ(outcome.out, two + ": 2 points, 24 values -> 8FE30209.oxlook (written)\n" + two +
                             ": 1 point, 3 values -> B5CB6ADA.oxlook (already there)\n" + two +
                             ": 1 point, 3 values -> 7BD5C66F.oxlook (written)\n");
}

TEST(LookImport, WithoutATableHasNothingToDo) {
  const LookFolder folder;
  const std::string sample = lookData + "no-table.xml";
  const Outcome outcome = folder.run({"import", sample});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_EQ(outcome.out, sample + ": nothing to do: it has no table\n");
  EXPECT_EQ(outcome.err, "oxmv: warning: " + sample +
                             ": no element <LUT> right below the root: there is nothing to import"
                             " (no-table)\n");
  EXPECT_EQ(folder.run({"import", "--strict", sample}).exitCode, 1);
}

TEST(LookImport, WarnsOfWhatIsOddInATable) {
  const LookFolder folder;
  const std::string few = lookData + "too-few-values.xml";
  const Outcome outcome = folder.run({"import", few});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_EQ(outcome.err,
            "oxmv: warning: " + few +
                ": line 1, column 26: 2 values, and a size of 2 takes 24: the missing 22 become 0;"
                " correct the size or the table (too-few-values)\n");
  const Json table = Json::parse(folder.run({"import", "--json", few}).out)[0]["tables"][0];
  EXPECT_EQ(table["values"], 2);
  EXPECT_EQ(table["missing"], 22);
}

TEST(LookImport, CountsSurplusAndMalformedValues) {
  const LookFolder folder;
  const auto tableOf = [&](const std::string& sample) {
    return Json::parse(folder.run({"import", "--json", lookData + sample}).out)[0]["tables"][0];
  };
  EXPECT_EQ(tableOf("too-many-values.xml")["surplus"], 1);
  EXPECT_EQ(tableOf("too-many-values.xml")["values"], 3);
  EXPECT_EQ(tableOf("malformed-group.xml")["malformed"], 1);
}

TEST(LookImport, TellsWhyItWasRefusedAndHowToMendThat) {
  const LookFolder folder;
  const std::string sample = lookData + "illegal/white-space-before-size.xml";
  const Outcome outcome = folder.run({"import", sample});
  EXPECT_EQ(outcome.exitCode, 4);
  EXPECT_EQ(outcome.out, "");
  EXPECT_EQ(outcome.err,
            "oxmv: refused: " + sample +
                ": line 1, column 12: Error : LUT (white-space-before-size.xml) has no defined"
                " table size (space-before-size); nothing written; white space before <size> counts"
                " as a table without a size: remove it, or import with --strip-space\n");
  const std::string large = lookData + "illegal/size-65.xml";
  EXPECT_EQ(folder.run({"import", large}).err,
            "oxmv: refused: " + large +
                ": line 1, column 12: Error : LUT (size-65.xml) is too large, a maximum of 64x64x64"
                " is supported (size-too-large); nothing written; a size of 65: 64 points per axis"
                " are the most\n");
}

TEST(LookImport, NamesTheTablesWrittenBeforeItWasRefused) {
  const LookFolder folder;
  const std::string file =
      folder.description("half.xml",
                         "<look><LUT><size>1</size><a>0000803F0000003F0000803E</a></LUT>"
                         "<LUT><a>0000803F</a></LUT></look>");
  const Outcome outcome = folder.run({"import", file});
  EXPECT_EQ(outcome.exitCode, 4);
  EXPECT_EQ(outcome.out, file + ": 1 point, 3 values -> " + warmLook + " (written)\n");
  EXPECT_NE(outcome.err.find("; the tables before it are written; "), std::string::npos)
      << outcome.err;
  EXPECT_TRUE(fs::exists(folder.look(warmLook)));
}

TEST(LookImport, NamesThePlaceOfWhatIsNoXml) {
  const LookFolder folder;
  const std::string sample = lookData + "illegal/not-well-formed.xml";
  const Outcome outcome = folder.run({"import", sample});
  EXPECT_EQ(outcome.exitCode, 3);
  EXPECT_EQ(outcome.err, "oxmv: error: " + sample +
                             ": line 1, column 55: this is no well-formed XML: mismatched tag;"
                             " nothing of it is imported (not-well-formed)\n");
}

TEST(LookImport, TheOthersOfABatchAreDone) {
  const LookFolder folder;
  const std::string good = folder.description("warm.xml", warm);
  const Outcome outcome =
      folder.run({"import", folder / "missing.xml", lookData + "illegal/no-size.xml", good});
  EXPECT_EQ(outcome.exitCode, 4);
  EXPECT_EQ(outcome.out, good + ": 1 point, 3 values -> " + warmLook + " (written)\n");
  EXPECT_EQ(linesOf(outcome.err).at(0),
            "oxmv: error: " + folder / "missing.xml" + ": No such file or directory (missing)");
  const Json missing =
      Json::parse(folder.run({"import", "--json", folder / "missing.xml"}).out).at(0);
  EXPECT_EQ(missing["reference"]["crc"], "00000000");
  EXPECT_EQ(missing["error"]["code"], "missing");
}

TEST(LookImport, StripsTheWhiteSpaceOfADescriptionLaidOutInLines) {
  const LookFolder folder;
  for (const std::string end : {"\n", "\r\n"}) {
    std::string text;
    for (const char* line :
         {"<look>", "  <LUT>", "    <size>", "      1", "    </size>", "    <a note=\"a > b\">",
          "      0000803F0000003F0000803E", "    </a>", "  </LUT>", "</look>"})
      text += line + end;
    const std::string file = folder.description("laid-out.xml", text);
    const Outcome refused = folder.run({"import", file});
    EXPECT_EQ(refused.exitCode, 4);
    EXPECT_NE(refused.err.find("import with --strip-space"), std::string::npos) << refused.err;
    EXPECT_TRUE(filesIn(folder.looks()).empty());

    const Outcome outcome = folder.run({"import", "--strip-space", file});
    EXPECT_EQ(outcome.exitCode, 0);
    EXPECT_EQ(outcome.err, "");
    EXPECT_EQ(outcome.out,
              file + ": 7 pieces of white space left out; its copy will have none either\n" + file +
                  ": 1 point, 3 values -> " + warmLook + " (written)\n");
    EXPECT_EQ(readFile(folder.look("laid-out.xml")),
              "<look>" + end +
                  "  <LUT><size>1</size><a note=\"a > b\">0000803F0000003F0000803E</a>"
                  "</LUT>" +
                  end + "</look>" + end);
    EXPECT_EQ(readFile(file), text);
    fs::remove(folder.look("laid-out.xml"));
    fs::remove(folder.look(warmLook));
  }
}

TEST(LookImport, PlacesAreThoseOfTheUsersFileAlsoWithoutItsWhiteSpace) {
  const LookFolder folder;
  const std::string file =
      folder.description("odd.xml",
                         "<look>\n<LUT>\n<size>1</size>\n<a>\n0000803F 00zz803E 0000003F\n</a>\n"
                         "</LUT></look>");
  const Outcome outcome = folder.run({"import", "--strip-space", file});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_EQ(outcome.err.find("oxmv: warning: " + file + ": line 5, column 10: "), 0u)
      << outcome.err;
}

TEST(LookImport, StripsNothingWhereThereIsNothing) {
  const LookFolder folder;
  const std::string file = folder.description("warm.xml", warm);
  const Outcome outcome = folder.run({"import", "--strip-space", file});
  EXPECT_EQ(outcome.out, file + ": 1 point, 3 values -> " + warmLook + " (written)\n");
  EXPECT_EQ(readFile(folder.look("warm.xml")), warm);
}

TEST(LookImport, StripsNothingInUtf16) {
  const LookFolder folder;
  std::string wide = "\xFF\xFE";
  for (const char c : lut("\n<size>1</size>")) wide += {c, '\0'};
  const Outcome outcome =
      folder.run({"import", "--strip-space", folder.description("w.xml", wide)});
  EXPECT_EQ(outcome.exitCode, 3);
  EXPECT_NE(outcome.err.find("save it as UTF-8 (not-stripped)"), std::string::npos) << outcome.err;
}

TEST(LookImport, StripsEveryKindOfNodeAsItIsMeant) {
  // Whatever is stripped, every other byte stays, and what is left is imported like the rest.
  const LookFolder folder;
  const std::string begin = "<!DOCTYPE look [<!ENTITY e ' <b/> '>]><look><LUT><size>1</size>";
  const std::string file = folder.description(
      "all.xml", begin +
                     " <![CDATA[ 0000803F ]]> <!-- c --> &e; <?p q?> <n><m> 0000003F </m> </n>"
                     " 00000040 </LUT></look>");
  const Outcome outcome = folder.run({"import", "-q", "--strip-space", file});
  EXPECT_EQ(outcome.exitCode, 0) << outcome.err;
  EXPECT_EQ(readFile(folder.look("all.xml")),
            begin +
                "<![CDATA[ 0000803F ]]><!-- c -->&e;<?p q?><n><m> 0000003F </m> </n>"
                "00000040</LUT></look>");
}

TEST(LookImport, SaysThatAnotherDescriptionOfTheNameIsThere) {
  const LookFolder folder;
  const std::string file = folder.description("warm.xml", warm);
  writeFile(folder.look("warm.xml"), "another");
  const Outcome outcome = folder.run({"import", file});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_EQ(outcome.err, "oxmv: warning: " + file + ": not copied: " + folder.look("warm.xml") +
                             " is there already and differs (copy-differs)\n");
  EXPECT_EQ(readFile(folder.look("warm.xml")), "another");
}

TEST(LookImport, TheSameDescriptionBeingThereIsNoSurprise) {
  const LookFolder folder;
  writeFile(folder.look("warm.xml"), warm);
  const Outcome outcome = folder.run({"import", folder.look("warm.xml")});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_EQ(outcome.err, "");
  EXPECT_TRUE(fs::exists(folder.look(warmLook)));
}

TEST(LookImport, ADryRunSaysTheSameAndWritesNothing) {
  for (const auto& [sample, expected] : samples().items()) {
    const LookFolder folder;
    const Outcome dry = folder.run({"import", "--json", "-n", path(sample)});
    EXPECT_TRUE(filesIn(folder.looks()).empty()) << sample;
    const Outcome wet = folder.run({"import", "--json", path(sample)});
    EXPECT_EQ(dry.out, wet.out) << sample;
    EXPECT_EQ(dry.err, wet.err) << sample;
    EXPECT_EQ(dry.exitCode, wet.exitCode) << sample;
    // And with the looks there.
    EXPECT_EQ(folder.run({"import", "--json", "-n", path(sample)}).out,
              folder.run({"import", "--json", path(sample)}).out)
        << sample;
  }
}

TEST(LookImport, ADryRunSaysWhatWouldBeWritten) {
  const LookFolder folder;
  const std::string file = folder.description("warm.xml", warm);
  EXPECT_EQ(folder.run({"import", "-n", file}).out,
            file + ": 1 point, 3 values -> " + warmLook + " (would be written)\n");
  writeFile(folder.look("warm.xml"), "another");
  EXPECT_NE(folder.run({"import", "-n", file}).err.find("(copy-differs)"), std::string::npos);
  EXPECT_EQ(readFile(folder.look("warm.xml")), "another");
}

TEST(LookImport, LeavesNoTemporaryFolders) {
  const LookFolder folder;
  const std::string file = folder.description("warm.xml", lut("\n<size>1</size>"));
  fs::create_directory(folder / "tmp");
  const Outcome outcome =
      runWith({"TMPDIR=" + folder / "tmp"},
              {"look", "import", "-n", "--strip-space", file, "--looks", folder.looks()});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_TRUE(fs::is_empty(folder / "tmp"));
}

TEST(LookImport, WithoutAFolderNamesTheVerbThatMakesIt) {
  const LookFolder folder;
  fs::remove(folder.looks());
  const std::string file = folder.description("warm.xml", warm);
  const Outcome outcome = folder.run({"import", "--json", file});
  EXPECT_EQ(outcome.exitCode, 3);
  EXPECT_EQ(outcome.err, "oxmv: error: " + folder.looks().string() +
                             ": there is no such look-table folder; oxmv look init makes it"
                             " (missing)\n");
  const Json result = Json::parse(outcome.out).at(0);
  EXPECT_EQ(result["file"], file);
  EXPECT_EQ(result["error"]["code"], "missing");
  EXPECT_FALSE(fs::exists(folder.looks()));
}

TEST(LookImport, NamesAFileThatCannotBeWritten) {
  const LookFolder folder;
  const std::string file = folder.description("warm.xml", warm);
  fs::create_directory(folder.look(warmLook));
  const Outcome outcome = folder.run({"import", file});
  EXPECT_EQ(outcome.exitCode, 3);
  EXPECT_EQ(outcome.out, "");
  EXPECT_EQ(outcome.err.find("oxmv: error: " + folder.look(warmLook) + ": "), 0u) << outcome.err;
  EXPECT_NE(outcome.err.find("(write-failed)\n"), std::string::npos) << outcome.err;
  EXPECT_EQ(Json::parse(folder.run({"import", "--json", file}).out)[0]["tables"][0]["written"],
            false);
}

TEST(LookImport, StopsWhereADescriptionHasMoreTablesThanOneImportWrites) {
  const LookFolder folder;
  std::string tables = "<size>1</size>";
  for (int i = 0; i < 4097; ++i) {
    std::string digits = std::to_string(10000000 + i);
    tables += "<a>" + digits + digits + digits + "</a>";
  }
  const std::string file = folder.description("many.xml", lut(tables));
  // Each of the thousands of files is waited for until the disk has it, so they go where none is.
  const std::string memory = fs::exists("/dev/shm") ? "/dev/shm" : fs::temp_directory_path();
  const Outcome outcome =
      runWith({"TMPDIR=" + memory}, {"look", "import", "-n", file, "--looks", folder.looks()});
  EXPECT_EQ(outcome.exitCode, 4);
  EXPECT_EQ(linesOf(outcome.out).size(), 4096u);
  EXPECT_TRUE(outcome.err.ends_with(
      "oxmv: refused: " + file +
      ": more than 4096 new tables: divide the description (too-much); nothing written\n"))
      << outcome.err;
}

TEST(LookImport, RefusesStandardInputWhichHasNoName) {
  EXPECT_EQ(run({"look", "import", "-"}).err,
            "oxmv: error: a look has the name of its file, and - has none (standard-input)\n");
  EXPECT_EQ(run({"look", "import", "-"}).exitCode, 2);
  EXPECT_EQ(run({"look", "import"}).exitCode, 2);
}

TEST(LookImport, TakesItsFilesFromAList) {
  const LookFolder folder;
  const std::string list = folder.description("list", folder.description("warm.xml", warm) + '\n');
  EXPECT_EQ(folder.run({"import", "--files-from", list}).exitCode, 0);
  EXPECT_TRUE(fs::exists(folder.look(warmLook)));
}

}  // namespace
}  // namespace oxmv::cli::test
