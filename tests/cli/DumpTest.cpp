#include <cstdint>
#include <map>
#include <random>
#include <string>
#include <vector>

#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include "oxmv/metadata/TagTable.h"
#include "tests/cli/CommandRunner.h"
#include "tests/support/StreamBuilder.h"
#include "tests/support/TempDir.h"
#include "tests/support/TestData.h"

namespace oxmv::cli::test {
namespace {

using Json = nlohmann::ordered_json;
using oxmv::test::Bytes;
using oxmv::test::StreamBuilder;
using oxmv::test::TempDir;

const std::string data = OXMV_TEST_DATA "/streams/";

std::string asText(const Bytes& bytes) { return {bytes.begin(), bytes.end()}; }

std::string dumpOf(const StreamBuilder& stream) {
  return run({"dump", "-"}, asText(stream.bytes())).out;
}

Json dumpAsJson(const Bytes& stream) {
  return Json::parse(run({"dump", "--json", "-"}, asText(stream)).out);
}

// Bytes of the outermost stream that records, markers and the unread rest account for.
std::size_t accountedFor(const Json& dump) {
  std::size_t sum = dump["trailing"];
  for (const char* list : {"records", "markers"}) {
    for (const Json& item : dump[list]) {
      if (item["level"] == 0) sum += item["length"].get<std::size_t>();
    }
  }
  return sum;
}

TEST(Dump, ShowsWhatStopsBehindAMarkerBehindIt) {
  const TempDir folder;
  const std::string file = (folder / "clip.colr").string();
  writeFile(
      file,
      StreamBuilder().record("TAKE", 'B', 1).marker(2).marker(2).record("SHOT", 'B', 2).bytes());
  const std::string out = run({"dump", file}).out;
  EXPECT_LT(out.find("    12  marker"), out.find("    16 "));
  EXPECT_NE(out.find("    16 "), std::string::npos);
}

TEST(Dump, ShowsEveryRecord) {
  const Outcome outcome = run({"dump", data + "eye-left.col1"});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_EQ(outcome.out,
            "OFFSET  TAG       SIZE  TYPE  READ AS         VALUE\n"
            "     0  TIMC        12  c     text            01:02:03:04\n"
            "    20  REEL        12  c     text            A001_C003L\n"
            "    40  HOFF         4  f     float           0.01\n"
            "3 records, 52 bytes, 0 not read\n");
  EXPECT_EQ(outcome.err, "");
}

TEST(Dump, IndentsNestedStreams) {
  EXPECT_EQ(run({"dump", data + "control-points.bin"}).out,
            "OFFSET  TAG         SIZE  TYPE  READ AS         VALUE\n"
            "     0  CTLp          20  00    control point, repeated\n"
            "    16    SATU         4  f     float           0.5\n"
            "    28  CTLp           8  00    control point, repeated\n"
            "    44  ....           0  00    -               end of the control points\n"
            "4 records, 52 bytes, 0 not read\n");
}

TEST(Dump, RemarksOnWhatIsIgnored) {
  EXPECT_EQ(
      dumpOf(StreamBuilder()
                 .record("WBAL", 'f', Bytes(12))
                 .record("ABCD", 'c', "x")
                 .record("GHTL", 'H', 1)
                 .record("TAGV", 'L', 1)),
      "OFFSET  TAG       SIZE  TYPE  READ AS         VALUE\n"
      "     0  WBAL        12  f     4 floats        ! WBAL size 12: ignored, needs 16\n"
      "    20  ABCD         1  c     -               ! ABCD: ignored, no such tag\n"
      "    32  GHTL         4  H     -               ! GHTL: ignored, this tag is never read\n"
      "    44  TAGV         4  L     value in \"TAG \"  ! TAGV: ignored, no name stands before it\n"
      "4 records, 56 bytes, 0 not read\n");
}

TEST(Dump, RemarksOnValuesThatAreReplacedLater) {
  const auto lines = linesOf(dumpOf(StreamBuilder()
                                        .record("REEL", 'c', "one")
                                        .record("TAGN", 'c', "ISO")
                                        .record("TAGV", 'L', 1)
                                        .record("TAGN", 'c', "ISO")
                                        .record("TAGV", 'L', 2)
                                        .record("REEL", 'c', "two")
                                        .record("KWRd", 'c', "a")
                                        .record("KWRd", 'c', "b")));
  ASSERT_EQ(lines.size(), 10u);
  EXPECT_TRUE(lines[1].ends_with("one  ! REEL: its value is replaced at byte 60")) << lines[1];
  EXPECT_TRUE(lines[3].ends_with("1  ! TAGV: its value is replaced at byte 48")) << lines[3];
  for (const std::size_t i : {2u, 4u, 5u, 6u, 7u, 8u})
    EXPECT_EQ(lines[i].find('!'), std::string::npos);
}

TEST(Dump, RemarksOnNestedStreamsThatAreReplaced) {
  const Bytes one = StreamBuilder().record("SATU", 'f', 1.0f).bytes();
  const auto lines = linesOf(dumpOf(StreamBuilder()
                                        .record("COL1", '\0', one)
                                        .record("COL1", '\0', Bytes())
                                        .record("COL1", '\0', one)));
  EXPECT_TRUE(lines[1].ends_with("! COL1: its value is replaced at byte 28")) << lines[1];
  EXPECT_TRUE(lines[3].ends_with("! COL1: ignored, its nested stream is empty")) << lines[3];
  EXPECT_EQ(lines[4].find('!'), std::string::npos);
}

TEST(Dump, RemarksOnNamesThatNothingFollows) {
  const auto lines = linesOf(dumpOf(StreamBuilder()
                                        .record("TAGN", 'c', "a")
                                        .record("REGN", 'c', "b")
                                        .record("TAGN", 'c', "c")
                                        .record("TAGV", 'L', 1)));
  EXPECT_TRUE(lines[1].ends_with("a  ! TAGN: ignored, no value follows it")) << lines[1];
  EXPECT_TRUE(lines[2].ends_with("! REGN: ignored, no value follows it")) << lines[2];
  EXPECT_EQ(lines[3].find('!'), std::string::npos);
}

TEST(Dump, RemarksOnEachRecordOfZeros) {
  const auto lines = linesOf(dumpOf(StreamBuilder().record("TAKE", 'B', 1).raw(Bytes(16))));
  EXPECT_TRUE(lines[2].ends_with("! 16 bytes of zeros: ignored")) << lines[2];
  EXPECT_TRUE(lines[3].ends_with("! zeros: ignored")) << lines[3];
}

TEST(Dump, ShowsMarkers) {
  EXPECT_EQ(run({"dump", data + "marker-raises-the-limit.bin"}).out,
            "OFFSET  TAG       SIZE  TYPE  READ AS         VALUE\n"
            "     0  PRCS         4  L     int32           1\n"
            "    12  marker: 12 bytes more\n"
            "    16  TIMB         4  B     uint8           25\n"
            "    28  TAKE         4  B     uint16          2\n"
            "3 records, 40 bytes, 0 not read\n");
}

TEST(Dump, ShowsWhatIsNotRead) {
  EXPECT_EQ(run({"dump", data + "truncated-second-record.bin"}).out,
            "OFFSET  TAG       SIZE  TYPE  READ AS         VALUE\n"
            "     0  REEL         4  c     text            ok!\n"
            "    12  ! 24 bytes not read: record NAME claims 20 bytes, 16 are left\n"
            "1 record, 36 bytes, 24 not read\n");
  EXPECT_EQ(linesOf(dumpOf(StreamBuilder().record("TAKE", 'B', 1).raw({1, 2, 3})))[2],
            "    12  ! 3 bytes not read: 3 bytes are left, a record needs 8");
}

TEST(Dump, NamesAPayloadThatIsCutEvenWhereItIsRead) {
  EXPECT_EQ(
      linesOf(dumpOf(StreamBuilder().header("REEL", 9000, 'c').raw({'a', 'b', 'c', 'd'})))[1],
      "     0  REEL      9000  c     text            abcd  ! REEL claims 9000 bytes, 4 are there;"
      " REEL: its text has no NUL at its end");
  EXPECT_EQ(linesOf(dumpOf(StreamBuilder().header("FREE", 9000, 'c').raw({1, 2, 3, 4})))[1],
            "     0  FREE      9000  c     data            ! record FREE claims 9000 bytes,"
            " 4 are left");
}

TEST(Dump, ShowsAFileThatIsTooShort) {
  EXPECT_EQ(run({"dump", data + "eleven-bytes.bin"}).out,
            "OFFSET  TAG       SIZE  TYPE  READ AS         VALUE\n"
            "     0  PRCS         4  L     int32           ! PRCS claims 4 bytes, 3 are there;"
            " PRCS: ignored, too few bytes left for its number\n"
            "! 11 bytes are too few: a clip with tags has 12 or more\n"
            "1 record, 11 bytes, 0 not read\n");
  EXPECT_EQ(run({"dump", "-"}, "").out,
            "OFFSET  TAG       SIZE  TYPE  READ AS         VALUE\n"
            "! 0 bytes are too few: a clip with tags has 12 or more\n"
            "0 records, 0 bytes, 0 not read\n");
}

TEST(Dump, CutsLongValuesUnlessVerbose) {
  const std::string stream = asText(StreamBuilder().record("FREE", 'c', Bytes(20, 0xAB)).bytes());
  EXPECT_NE(run({"dump", "-"}, stream).out.find("abababababababababababababababab... (20 bytes)"),
            std::string::npos);
  EXPECT_NE(run({"dump", "-v", "-"}, stream)
                .out.find("abababababababababababababababababababab (20 bytes)"),
            std::string::npos);
}

TEST(Dump, GivesJsonOfAFixedShape) {
  EXPECT_EQ(run({"dump", "--json", data + "truncated-second-record.bin"}).out,
            "{\"schema\":\"oxmv.dump/1\",\"file\":\"" + data +
                "truncated-second-record.bin\",\"bytes\":36,\"records\":[\n"
                " {\"offset\":0,\"tag\":\"REEL\",\"size\":4,\"type\":\"c\",\"length\":12,"
                "\"level\":0,\"reads\":\"text\",\"value\":\"ok!\",\"remark\":null}],"
                "\"markers\":[],\"unread\":[{\"offset\":12,\"length\":24,\"level\":0,"
                "\"code\":\"truncated-record\",\"message\":"
                "\"record NAME claims 20 bytes, 16 are left\"}],"
                "\"trailing\":24,\"remark\":null,\"error\":null}\n");
}

TEST(Dump, GivesTagsAndTypesOfAnyBytesInJson) {
  const Json dump =
      dumpAsJson(StreamBuilder().raw({0xBF, 0xFE, 0, 'A', 4, 0, 0, 0xFF, 1, 2, 3, 4}).bytes());
  EXPECT_EQ(dump["records"][0]["tag"], std::string("\u00BF\u00FE\0A", 6));
  EXPECT_EQ(dump["records"][0]["type"], "\u00FF");
  EXPECT_TRUE(dump["records"][0]["reads"].is_null());
  EXPECT_TRUE(dump["records"][0]["value"].is_null());
  EXPECT_EQ(dump["records"][0]["remark"], "\\xBF\\xFE\\x00A: ignored, no such tag");
}

TEST(Dump, GivesMarkersInJson) {
  const Json dump = Json::parse(run({"dump", "--json", data + "marker-raises-the-limit.bin"}).out);
  EXPECT_EQ(dump["markers"].dump(), R"([{"offset":12,"length":4,"level":0,"more":12}])");
  EXPECT_EQ(accountedFor(dump), 40u);
}

TEST(Dump, GivesAnObjectForAFileThatCannotBeRead) {
  const Outcome outcome = run({"dump", "--json", "missing"});
  EXPECT_EQ(outcome.exitCode, 3);
  EXPECT_EQ(outcome.out,
            "{\"schema\":\"oxmv.dump/1\",\"file\":\"missing\",\"bytes\":null,\"records\":null,"
            "\"markers\":null,\"unread\":null,\"trailing\":null,\"remark\":null,"
            "\"error\":{\"code\":\"missing\",\"message\":\"No such file or directory\"}}\n");
  EXPECT_EQ(run({"dump", "missing"}).out, "");
}

TEST(Dump, AccountsForEveryByteOfTheSamples) {
  for (const std::string& name : oxmv::test::testDataNames("streams", ".json")) {
    const Bytes stream = oxmv::test::testData("streams/" + name);
    EXPECT_EQ(accountedFor(dumpAsJson(stream)), stream.size()) << name;
  }
}

// Records, some of them nested, damaged here and there.
class RandomStream {
 public:
  explicit RandomStream(unsigned seed) : random_(seed) {}

  Bytes make() {
    Bytes stream = records(0);
    for (int i = below(4); i > 0 && !stream.empty(); --i)
      stream[static_cast<std::size_t>(below(static_cast<int>(stream.size())))] =
          static_cast<std::uint8_t>(below(4) == 0 ? 0xFF : below(256));
    stream.resize(stream.size() - static_cast<std::size_t>(below(8)) % (stream.size() + 1));
    return stream;
  }

 private:
  int below(int end) { return std::uniform_int_distribution<int>(0, end - 1)(random_); }

  Bytes records(int level) {
    static const std::vector<std::string> tags = {"REEL", "TAKE", "WBAL", "FREE", "KWRd", "TAGN",
                                                  "TAGV", "REGN", "REGV", "GUID", "BADP", "ZZZZ"};
    StreamBuilder stream;
    for (int i = below(6); i >= 0; --i) {
      if (below(4) == 0 && level < 4) {
        Bytes nested = records(level + 1);
        const std::string tag =
            std::vector<std::string>{"COL1", "DSPm", "CTLp"}[static_cast<std::size_t>(below(3))];
        if (tag == "CTLp") nested.insert(nested.begin(), 8, 1);
        stream.record(tag, '\0', nested);
      } else if (below(8) == 0) {
        stream.marker(static_cast<std::uint16_t>(below(5)));
      } else if (below(12) == 0) {
        stream.raw(Bytes(8));
      } else {
        const auto& tag = tags[static_cast<std::size_t>(below(static_cast<int>(tags.size())))];
        stream.record(tag, "cLfH"[below(4)], Bytes(static_cast<std::size_t>(below(18)), 'x'));
      }
    }
    return stream.bytes();
  }

  std::mt19937 random_;
};

// Of each nested stream that is read, what stands in it takes all its bytes.
void expectNestedStreamsAreFull(const Json& dump) {
  struct Item {
    std::size_t offset, length;
    int level;
  };
  std::vector<Item> items;
  for (const char* list : {"records", "markers", "unread"}) {
    for (const Json& item : dump[list])
      items.push_back({item["offset"], item["length"], item["level"]});
  }
  for (const Json& record : dump["records"]) {
    const std::size_t start = record["offset"];
    const std::size_t size = record["size"];
    const std::size_t length = record["length"];
    if (length < 8 + size) continue;  // cut, or its length has wrapped
    const std::size_t before = record["tag"] == "CTLp" ? 8 : 0;
    std::size_t sum = 0;
    for (const Item& item : items) {
      const bool isWithin = start + 8 + before <= item.offset && item.offset < start + 8 + size;
      if (item.level == record["level"].get<int>() + 1 && isWithin) sum += item.length;
    }
    if (sum == 0) continue;  // holds no stream
    EXPECT_EQ(sum, size - before) << dump.dump(1);
  }
}

TEST(Dump, AccountsForEveryByteOfDamagedStreams) {
  for (unsigned seed = 0; seed < 150; ++seed) {
    const Bytes stream = RandomStream(seed).make();
    const Json dump = dumpAsJson(stream);
    EXPECT_EQ(accountedFor(dump), stream.size()) << seed << dump.dump(1);
    expectNestedStreamsAreFull(dump);
  }
}

TEST(Dump, AccountsForEveryByteWhereLengthsWrap) {
  for (const std::uint32_t size :
       {0xFFFFF4u, 0xFFFFF5u, 0xFFFFF8u, 0xFFFFF9u, 0xFFFFFCu, 0xFFFFFDu, 0xFFFFFFu}) {
    for (const char* tag : {"REEL", "FREE", "TAKE", "DSPm", "ZZZZ"}) {
      const Bytes stream =
          StreamBuilder().header(tag, size, 'c').record("TAKE", 'B', 1).raw(Bytes(7)).bytes();
      EXPECT_EQ(accountedFor(dumpAsJson(stream)), stream.size()) << tag << size;
    }
  }
}

TEST(Dump, ReadsEveryTagAsTheTableSays) {
  StreamBuilder stream;
  std::map<std::string, std::string> expected;
  for (const TagRow& row : tagRows()) {
    const auto characters = charactersOf(row.tag);
    const std::string tag(characters.begin(), characters.end());
    stream.record(tag, 'c', Bytes(4));
    expected[tag] = readsAs(row);
  }
  const Json dump = dumpAsJson(stream.bytes());
  EXPECT_EQ(dump["records"].size(), tagRows().size());
  for (const Json& record : dump["records"]) EXPECT_EQ(record["reads"], expected[record["tag"]]);
}

}  // namespace
}  // namespace oxmv::cli::test
