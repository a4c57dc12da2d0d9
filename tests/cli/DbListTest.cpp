#include <cstddef>
#include <filesystem>
#include <set>
#include <string>
#include <vector>

#include <gtest/gtest.h>
#include <sys/stat.h>

#include "tests/cli/CommandRunner.h"
#include "tests/cli/TemporaryDatabase.h"
#include "tests/support/Files.h"
#include "tests/support/StreamBuilder.h"

namespace oxmv::cli::test {
namespace {

using oxmv::test::Bytes;
using oxmv::test::StreamBuilder;

const std::string one = "0A1B2C3D-4E5F-0607-0809-AABBCCDDEE01";
const std::string two = "0A1B2C3D-4E5F-0607-0809-AABBCCDDEE02";
const std::string three = "FF1B2C3D-4E5F-0607-0809-AABBCCDDEE03";

Bytes reel(const std::string& name) { return StreamBuilder().record("REEL", 'c', name).bytes(); }

// A typical clip, a stereo clip, and one of which readers get nothing.
class DbList : public testing::Test {
 protected:
  DbList() {
    database.put(three + ".colr", Bytes());
    database.put(one + ".colr", readFile(OXMV_SOURCE_DIR "/examples/typical-clip.colr"));
    database.put(two + ".col2", readFile(OXMV_SOURCE_DIR "/examples/eye-right.col2"));
    database.put(two + ".col1", readFile(OXMV_SOURCE_DIR "/examples/eye-left.col1"));
  }

  // The command succeeds, and says nothing.
  std::string listing(std::vector<std::string> flags = {}) {
    flags.insert(flags.begin(), {"db", "list"});
    const Outcome outcome = database.run(flags);
    EXPECT_EQ(outcome.exitCode, 0);
    EXPECT_EQ(outcome.err, "");
    return outcome.out;
  }

  const TemporaryDatabase database;
};

TEST_F(DbList, IsATableOfClipsByGuid) {
  EXPECT_EQ(listing(),
            "GUID                                  EYES        REEL          TIMC          DATE"
            "          SCEN   SHOT   TAKE   LOOK\n" +
                one +
                "  combined    A001_C003     01:02:03:04   2026-03-14    12     4      2"
                "      Warm.oxlook\n" +
                two +
                "  left+right  A001_C003L    01:02:03:04   -             -      -      -      -\n" +
                three +
                "  combined    -             -             -             -      -      -      -\n");
}

TEST_F(DbList, IsCsv) {
  EXPECT_EQ(listing({"--csv"}),
            "guid,eyes,REEL,TIMC,DATE,SCEN,SHOT,TAKE,LOOK\n" + one +
                ",combined,A001_C003,01:02:03:04,2026-03-14,12,4,2,Warm.oxlook\n" + two +
                ",left+right,A001_C003L,01:02:03:04,,,,,\n" + three + ",combined,,,,,,,\n");
}

TEST_F(DbList, IsJsonOfFiles) {
  const auto object = [&](const std::string& guid, const std::string& eye, const std::string& file,
                          const std::string& tags) {
    return "{\"schema\":\"oxmv.clip/1\",\"guid\":\"" + guid + "\",\"eye\":\"" + eye +
           "\",\"file\":\"" + database.path(file) + "\",\"tags\":{" + tags + "},\"error\":null}";
  };
  const std::vector<std::string> objects = {
      object(one, "combined", one + ".colr",
             "\"REEL\":\"A001_C003\",\"TIMC\":\"01:02:03:04\",\"DATE\":\"2026-03-14\",\"SCEN\":12,"
             "\"SHOT\":4,\"TAKE\":2,\"LOOK\":\"Warm.oxlook\""),
      object(two, "left", two + ".col1", "\"REEL\":\"A001_C003L\",\"TIMC\":\"01:02:03:04\""),
      object(two, "right", two + ".col2", "\"REEL\":\"A001_C003R\",\"TIMC\":\"01:02:03:04\""),
      object(three, "combined", three + ".colr", "")};
  std::string lines;
  for (const std::string& text : objects) lines += text + '\n';
  EXPECT_EQ(listing({"--ndjson"}), lines);
  EXPECT_EQ(listing({"--json"}), "[\n" + objects[0] + ",\n" + objects[1] + ",\n" + objects[2] +
                                     ",\n" + objects[3] + "\n]\n");
}

TEST_F(DbList, TakesOtherColumns) {
  EXPECT_EQ(listing({"--columns", "HOFF, White balance", "--csv"}),
            "guid,eyes,HOFF,White balance\n" + one + ",combined,0.0,1.0 1.2 1.05 1.5\n" + two +
                ",left+right,0.01,\n" + three + ",combined,,\n");
  EXPECT_EQ(linesOf(listing({"--columns", "TAKE,White balance"}))[1],
            one + "  combined    2      1.0 1.2 1.05 1.5");
  EXPECT_NE(listing({"--columns", "HOFF", "--ndjson"}).find("\"tags\":{\"HOFF\":0.01}"),
            std::string::npos);
  const Outcome unknown = database.run({"db", "list", "--columns", "RELE"});
  EXPECT_EQ(unknown.exitCode, 2);
  EXPECT_EQ(unknown.err,
            "oxmv: error: no tag \"RELE\"; did you mean REEL (Reel name)? (unknown-tag)\n");
}

TEST_F(DbList, ShowsTheCombinedFileBeforeTheEyes) {
  database.put(two + ".colr", reel("both"));
  database.put(two + ".col10", reel("tenth"));
  EXPECT_EQ(linesOf(listing({"--csv", "--columns", "REEL"}))[2],
            two + ",combined+left+right+9,both");
}

TEST_F(DbList, GoesOnBehindAClipThatCannotBeRead) {
  std::filesystem::remove(database.folder() / (one + ".colr"));
  std::filesystem::create_symlink("nowhere", database.folder() / (one + ".colr"));
  ASSERT_EQ(::mkfifo(database.path(three + ".col1").c_str(), 0600), 0);
  std::filesystem::remove(database.folder() / (three + ".colr"));
  const Outcome table = database.run({"db", "list"});
  EXPECT_EQ(table.exitCode, 3);
  EXPECT_EQ(table.err, "oxmv: error: " + database.path(one + ".colr") +
                           ": No such file or directory (missing)\n" + "oxmv: error: " +
                           database.path(three + ".col1") + ": Not a regular file (not-a-file)\n");
  const auto lines = linesOf(table.out);
  ASSERT_EQ(lines.size(), 4u);
  EXPECT_EQ(lines[1], one + "  combined    (not read)");
  EXPECT_TRUE(lines[2].starts_with(two + "  left+right  A001_C003L"));
  EXPECT_EQ(lines[3], three + "  left        (not read)");

  const Outcome json = database.run({"db", "list", "--ndjson"});
  EXPECT_EQ(json.exitCode, 3);
  EXPECT_EQ(linesOf(json.out)[0],
            "{\"schema\":\"oxmv.clip/1\",\"guid\":\"" + one +
                "\",\"eye\":\"combined\",\"file\":\"" + database.path(one + ".colr") +
                "\",\"tags\":null,\"error\":{\"code\":\"missing\",\"message\":\"No such file or "
                "directory\"}}");
  EXPECT_EQ(linesOf(json.out).size(), 4u);
  EXPECT_EQ(linesOf(database.run({"db", "list", "--csv"}).out)[1], one + ",combined,,,,,,,");
}

TEST_F(DbList, LeavesOutWhatIsNoClip) {
  database.put("notes.txt", reel("x"));
  database.put(one + ".colr~", reel("x"));
  database.put("0a1b2c3d-4e5f-0607-0809-aabbccddee0f.colr", reel("x"));
  std::filesystem::create_directory(database.folder() / "folder");
  EXPECT_EQ(linesOf(listing()).size(), 4u);
}

TEST_F(DbList, ShowsNoControlCharacters) {
  database.put(three + ".colr", reel("a\x1B[31m"));
  EXPECT_NE(listing().find("a\\x1B[31m"), std::string::npos);
  EXPECT_EQ(listing().find('\x1B'), std::string::npos);
}

TEST_F(DbList, CountsOnlyWhatAStreamCanHold) {
  database.put(three + ".colr", std::string("TAKE\1\0\0B\7\0\0", 11));  // one byte short
  EXPECT_TRUE(listing({"--csv"}).ends_with(three + ",combined,,,,,,,\n"));
}

TEST_F(DbList, CountsThemWhenVerbose) {
  const Outcome outcome = database.run({"db", "list", "-v"});
  EXPECT_EQ(outcome.err, "oxmv: note: " + database.folder().string() + ": 3 clips, 4 files\n");
}

TEST_F(DbList, ShowsItsProgressOnATerminalOnly) {
  const std::vector<std::string> call = {"db",      "list", "--db", database.folder().string(),
                                         "--color", "never"};
  const auto with = [&](const std::string& flag) {
    std::vector<std::string> all = call;
    all.push_back(flag);
    return runOnTerminal(all).out;
  };
  const std::string shown = runOnTerminal(call).out;
  EXPECT_TRUE(shown.starts_with("0 of 4 files")) << shown;
  // Nothing of it is left: it is erased before anything else is written.
  const std::size_t erased = shown.find("\x1B[K");
  ASSERT_NE(erased, std::string::npos);
  EXPECT_EQ(shown.substr(erased + 3), listing());
  EXPECT_EQ(with("--no-progress"), listing());
  EXPECT_EQ(with("--quiet"), listing());
  EXPECT_EQ(runOnTerminal(call, {"TERM=dumb"}).out, listing());
}

TEST_F(DbList, ListsThousandsOfClipsInOrder) {
  std::set<std::string> guids = {one, two, three};
  for (int i = 0; i < 2000; ++i) {
    std::string guid = one;
    const std::string digits = std::to_string(i * 7919 % 10007 + 10000);
    guid.replace(0, digits.size(), digits);
    database.put(guid + ".colr", reel(digits));
    guids.insert(guid);
  }
  std::vector<std::string> listed;
  for (const std::string& line : linesOf(listing({"--csv"}))) listed.push_back(line.substr(0, 36));
  EXPECT_EQ(std::vector<std::string>(listed.begin() + 1, listed.end()),
            std::vector<std::string>(guids.begin(), guids.end()));
}

TEST(DbListOfNothing, IsATableWithoutLines) {
  const TemporaryDatabase database;
  const Outcome outcome = database.run({"db", "list"});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_EQ(linesOf(outcome.out).size(), 1u);
  EXPECT_EQ(database.run({"db", "list", "--json"}).out, "[]\n");
  EXPECT_EQ(database.run({"db", "list", "--ndjson"}).out, "");
}

TEST(DbListOfNothing, SaysHowADatabaseIsMade) {
  const TemporaryDatabase database;
  std::filesystem::remove(database.folder());
  const Outcome outcome = database.run({"db", "list", "--json"});
  EXPECT_EQ(outcome.exitCode, 3);
  EXPECT_EQ(outcome.out, "[]\n");
  EXPECT_EQ(outcome.err, "oxmv: error: " + database.folder().string() +
                             ": No such file or directory; oxmv db init makes it (missing)\n");
}

TEST(DbListOfNothing, NamesADatabaseThatIsNoFolder) {
  const TemporaryDatabase database;
  std::filesystem::remove(database.folder());
  writeFile(database.folder(), reel("x"));
  const Outcome outcome = database.run({"db", "list"});
  EXPECT_EQ(outcome.exitCode, 3);
  EXPECT_EQ(outcome.err,
            "oxmv: error: " + database.folder().string() + ": Not a directory (missing)\n");
}

// Two threads read them, in batches that grow.
TEST(DbListOfThousands, KeepsTheirOrderInEveryForm) {
  const TemporaryDatabase database;
  std::vector<std::string> guids;
  for (int i = 0; i < 3000; ++i) {
    guids.push_back(nthGuid(i));
    database.put(guids.back() + ".colr", i % 1000 == 999 ? Bytes(4, 1) : reel(guids.back()));
  }
  for (const std::string form : {"--no-progress", "--csv", "--ndjson"}) {
    const Outcome outcome = database.run({"db", "list", "--columns", "REEL", form});
    EXPECT_EQ(outcome.exitCode, 0);
    auto lines = linesOf(outcome.out);
    if (form != "--ndjson") lines.erase(lines.begin());
    ASSERT_EQ(lines.size(), guids.size());
    for (std::size_t i = 0; i < guids.size(); ++i) {
      const std::size_t times = i % 1000 == 999 ? 1 : 2;
      std::size_t found = 0;
      const auto start = form == "--ndjson" ? lines[i].find("\"tags\"") : 0;
      for (auto at = lines[i].find(guids[i]); at != std::string::npos;
           at = lines[i].find(guids[i], at + 1))
        found += at >= start || form != "--ndjson";
      EXPECT_EQ(found, form == "--ndjson" ? times - 1 : times) << lines[i];
    }
  }
  EXPECT_EQ(linesOf(database.run({"db", "list", "--json"}).out).size(), guids.size() + 2);
}

TEST(DbListOfThousands, NamesTheFilesThatCannotBeReadInTheirOrder) {
  const TemporaryDatabase database;
  std::vector<std::string> unread;
  for (int i = 0; i < 3000; ++i) {
    const std::string name = nthGuid(i) + ".colr";
    if (i % 500 != 7) {
      database.put(name, Bytes());
    } else {
      std::filesystem::create_symlink("nowhere", database.folder() / name);
      unread.push_back("oxmv: error: " + database.path(name) +
                       ": No such file or directory (missing)");
    }
  }
  const Outcome outcome = database.run({"db", "list"});
  EXPECT_EQ(outcome.exitCode, 3);
  EXPECT_EQ(linesOf(outcome.err), unread);
  EXPECT_EQ(linesOf(outcome.out).size(), 3001u);
}

}  // namespace
}  // namespace oxmv::cli::test
