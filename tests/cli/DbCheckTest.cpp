#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <filesystem>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "cli/Findings.h"
#include "oxmv/metadata/TagStreamDecoder.h"
#include "tests/cli/CommandRunner.h"
#include "tests/cli/TemporaryDatabase.h"
#include "tests/support/StreamBuilder.h"
#include "tests/support/WideLong.h"

namespace oxmv::cli::test {
namespace {

using oxmv::test::Bytes;
using oxmv::test::StreamBuilder;

const std::string guid = "0A1B2C3D-4E5F-0607-0809-AABBCCDDEE0F";
const std::string example = readFile(OXMV_SOURCE_DIR "/examples/eye-left.col1");

// The lines that `db check` prints; each begins with the path of what it is about.
std::vector<std::string> findingsIn(const TemporaryDatabase& database) {
  const Outcome outcome = database.run({"db", "check"});
  EXPECT_EQ(outcome.exitCode, outcome.out.empty() ? 0 : 1);
  EXPECT_EQ(outcome.err, "");
  return linesOf(outcome.out);
}

using Lines = std::vector<std::string>;

TEST(DbCheck, SaysNothingWhenAllIsWell) {
  const TemporaryDatabase database;
  EXPECT_EQ(findingsIn(database), Lines());
  database.put(guid + ".colr", example);
  database.put(guid + ".col1", example);
  database.put("1A1B2C3D-4E5F-0607-0809-AABBCCDDEE0F.col1", example);  // a stereo clip
  database.put("1A1B2C3D-4E5F-0607-0809-AABBCCDDEE0F.col2", example);
  database.put("2A1B2C3D-4E5F-0607-0809-AABBCCDDEE0F.colr", Bytes());  // a clip without tags
  database.put(guid + ".colr~", example);                              // backups
  database.put(guid + ".col1~12", example);
  std::filesystem::create_directory(database.folder() / "folder");
  EXPECT_EQ(findingsIn(database), Lines());
}

TEST(DbCheck, FindsFilesThatCannotBeRead) {
  const TemporaryDatabase database;
  std::filesystem::create_symlink("nowhere", database.folder() / (guid + ".colr"));
  std::filesystem::create_directory(database.folder() / (guid + ".col1"));
  EXPECT_EQ(findingsIn(database),
            (Lines{database.path(guid + ".colr: No such file or directory (unreadable)"),
                   database.path(guid + ".col1: Is a directory (unreadable)")}));
}

TEST(DbCheck, FindsEmptyFilesOfEyes) {
  const TemporaryDatabase database;
  database.put(guid + ".colr", example);
  database.put(guid + ".col1", Bytes());
  EXPECT_EQ(
      findingsIn(database),
      Lines{database.path(guid + ".col1: is empty: an eye without tags has no file (empty)")});
}

TEST(DbCheck, FindsEyesThatAreLeftAlone) {
  const TemporaryDatabase database;
  database.put(guid + ".col2", example);
  EXPECT_EQ(findingsIn(database),
            Lines{database.path(guid + ".col2: is all there is of its clip: no combined file, no "
                                       "other eye (orphan-eye)")});
}

TEST(DbCheck, FindsGuidRecordsThatDifferFromTheName) {
  const TemporaryDatabase database;
  const std::string image = oxmv::test::guidImage("\1\2\3\4",
                                                  "\5\6\7\x8"
                                                  "abcdefgh");
  const Bytes stream = StreamBuilder().record("GUID", 'G', image).bytes();
  const std::string named = "04030201-0605-0807-6162-636465666768";
  database.put(named + ".colr", stream);
  database.put(guid + ".colr", stream);
  database.put(guid + ".col1", stream);
  const std::string says = ": its GUID record says " + named + " (guid-differs)";
  EXPECT_EQ(findingsIn(database),
            (Lines{database.path(guid + ".colr" + says), database.path(guid + ".col1" + says)}));
}

TEST(DbCheck, FindsDamagedStreams) {
  const TemporaryDatabase database;
  database.put(guid + ".colr", readFile(OXMV_TEST_DATA "/streams/truncated-second-record.bin"));
  database.put("1A1B2C3D-4E5F-0607-0809-AABBCCDDEE0F.colr", std::string("abc"));
  const Lines found = findingsIn(database);
  ASSERT_EQ(found.size(), 2u);
  EXPECT_TRUE(found[0].starts_with(
      database.path(guid + ".colr: stopped at byte 12: record NAME claims 20 bytes, 16 are left")))
      << found[0];
  EXPECT_TRUE(found[0].ends_with("(damaged)")) << found[0];
  EXPECT_TRUE(found[1].ends_with("(damaged)")) << found[1];
}

TEST(DbCheck, LeavesWhatIsNoDamageToCheck) {
  const TemporaryDatabase database;
  database.put(guid + ".colr",
               readFile(OXMV_TEST_DATA "/streams/white-balance-of-three-is-ignored.bin"));
  EXPECT_EQ(findingsIn(database), Lines());
  EXPECT_EQ(database.run({"check", guid}).exitCode, 1);
}

TEST(DbCheck, FindsNamesThatNoHostWillFind) {
  const TemporaryDatabase database;
  database.put("0a1b2c3d-4e5f-0607-0809-aabbccddee0f.colr", example);
  database.put(guid + ".COL1", example);
  database.put(guid + ".col0", example);
  database.put(guid + ".txt", example);
  database.put(guid, example);
  database.put("clip.colr", example);
  const std::string only = " only (wrong-name)";
  const std::string extension =
      ": has the extension of no clip: colr, or col1, col2 ... of an eye (wrong-name)";
  EXPECT_EQ(
      findingsIn(database),
      (Lines{database.path(guid + extension),
             database.path(guid + ".COL1: would be found under the name " + guid + ".col1" + only),
             database.path(guid + ".col0" + extension), database.path(guid + ".txt" + extension),
             database.path("0a1b2c3d-4e5f-0607-0809-aabbccddee0f.colr: would be found under "
                           "the name " +
                           guid + ".colr" + only),
             database.path("clip.colr: is the name of no clip: a GUID, and colr, col1, col2 "
                           "... behind it (wrong-name)")}));
}

TEST(DbCheck, FindsWhatACutWriteLeft) {
  const TemporaryDatabase database;
  database.put(".oxmv-0123456789abcdef.tmp", example);
  EXPECT_EQ(findingsIn(database),
            Lines{database.path(".oxmv-0123456789abcdef.tmp: was left behind when a write was cut "
                                "short; it can be removed (leftover)")});
}

TEST(DbCheck, GivesJsonOfWhatHasFindings) {
  const TemporaryDatabase database;
  database.put("1A1B2C3D-4E5F-0607-0809-AABBCCDDEE0F.colr", example);
  database.put(guid + ".col1", Bytes());
  database.put("x", example);
  const Outcome outcome = database.run({"db", "check", "--ndjson"});
  EXPECT_EQ(outcome.exitCode, 1);
  const std::string eye =
      "{\"schema\":\"oxmv.db.check/1\",\"file\":\"" + database.path(guid + ".col1") +
      "\",\"guid\":\"" + guid +
      "\",\"eye\":\"left\",\"findings\":[{\"code\":\"orphan-eye\",\"message\":\"is all there is of "
      "its clip: no combined file, no other eye\"},{\"code\":\"empty\",\"message\":\"is empty: an "
      "eye without tags has no file\"}],\"error\":null}\n";
  EXPECT_TRUE(outcome.out.starts_with(eye)) << outcome.out;
  EXPECT_TRUE(outcome.out.substr(eye.size())
                  .starts_with("{\"schema\":\"oxmv.db.check/1\",\"file\":\"" + database.path("x") +
                               "\",\"guid\":null,\"eye\":null,\"findings\":[{"))
      << outcome.out;
  EXPECT_EQ(linesOf(outcome.out).size(), 2u);
}

TEST(DbCheck, NamesADatabaseThatIsNotThere) {
  const TemporaryDatabase database;
  std::filesystem::remove(database.folder());
  const Outcome outcome = database.run({"db", "check"});
  EXPECT_EQ(outcome.exitCode, 3);
  EXPECT_EQ(outcome.err, "oxmv: error: " + database.folder().string() +
                             ": No such file or directory; oxmv db init makes it (missing)\n");
}

// Streams that are plainly whole are not decoded. Those that only seem to be must be.
TEST(DbCheck, FindsTheDamageThatDecodingFinds) {
  const Bytes nested = StreamBuilder().record("REEL", 'c', "A001").bytes();
  const Bytes points =
      StreamBuilder()
          .record("CTLp", 0,
                  std::string("\1\0\0\0\2\0\0\0", 8) + std::string(nested.begin(), nested.end()))
          .bytes();
  const std::string inner(points.begin(), points.end());
  const Bytes whole = StreamBuilder()
                          .record("ABCD", 'c', "unknown")
                          .record("COL1", 0, inner)
                          .record("TAKE", 'L', 7)
                          .record("REEL", 'c', "A001_C003")
                          .bytes();
  const TemporaryDatabase database;
  std::vector<std::string> damaged;
  int number = 0;
  const auto put = [&](const Bytes& stream) {
    const std::string name = nthGuid(number++) + ".colr";
    database.put(name, stream);
    FindingCollector collector(stream);
    if (stream.size() >= 12)
      decodeStream(stream, static_cast<std::int32_t>(stream.size()), nullptr, &collector);
    const auto findings = collector.finish();
    const bool isDamaged = std::any_of(findings.begin(), findings.end(), [](const Finding& f) {
      return f.oddity == Oddity::stopped || f.oddity == Oddity::cutPayload ||
             (f.oddity == Oddity::tooShort && f.count > 0);
    });
    if (isDamaged) damaged.push_back(database.path(name));
  };
  for (std::size_t size = 0; size <= whole.size(); ++size)
    put(Bytes(whole.begin(), whole.begin() + static_cast<std::ptrdiff_t>(size)));
  for (std::size_t at = 0; at < whole.size(); ++at) {
    for (const int byte : {0x00, 0x04, 0xBF, 0xFF}) {
      Bytes changed = whole;
      changed[at] = static_cast<std::uint8_t>(byte);
      put(changed);
    }
  }
  std::vector<std::string> found;
  for (const std::string& line : findingsIn(database))
    found.push_back(line.substr(0, line.find(": ")));
  EXPECT_EQ(found, damaged);
  EXPECT_GT(damaged.size(), whole.size());
}

TEST(DbCheck, LooksAtEveryOneOfThousandsOfFiles) {
  const TemporaryDatabase database;
  Lines expected;
  for (int i = 0; i < 3000; ++i) {
    const std::string name = nthGuid(i) + ".colr";
    const bool isDamaged = i % 700 == 3;
    database.put(name, isDamaged ? Bytes{1} : Bytes());
    if (isDamaged)
      expected.push_back(database.path(
          name + ": byte 0: 1 bytes are too few: a clip with tags has 12 or more (damaged)"));
  }
  EXPECT_EQ(findingsIn(database), expected);
}

}  // namespace
}  // namespace oxmv::cli::test
