#include <string>
#include <vector>

#include <gtest/gtest.h>
#include <sys/stat.h>

#include "oxmv/metadata/TagTable.h"
#include "tests/cli/CommandRunner.h"
#include "tests/cli/EditedClip.h"
#include "tests/support/StreamBuilder.h"
#include "tests/support/TempDir.h"

namespace oxmv::cli::test {
namespace {

using oxmv::test::StreamBuilder;
using oxmv::test::TempDir;
using Words = std::vector<std::string>;

Outcome set(const EditedClip& clip, const Words& words) {
  Words arguments = {"set", clip.path()};
  arguments.insert(arguments.end(), words.begin(), words.end());
  return run(arguments);
}

std::string valueOf(const std::string& clip, const std::string& tag) {
  return run({"get", clip, tag}).out;
}

// The one assignment works, silently, and the tag is then as `value` says.
void expectSet(const std::string& assignment, const std::string& tag, const std::string& value) {
  const EditedClip clip;
  const Outcome outcome = set(clip, {assignment});
  EXPECT_EQ(outcome.exitCode, 0) << assignment << '\n' << outcome.err;
  EXPECT_EQ(outcome.out + outcome.err, "");
  EXPECT_EQ(valueOf(clip.path(), tag), value + '\n') << assignment;
}

// It is refused with these words behind the file's name, and the file is as it was.
void expectRefused(const Words& words, const std::string& severity, const std::string& message) {
  const EditedClip clip;
  const Outcome outcome = set(clip, words);
  EXPECT_EQ(outcome.exitCode, 4) << outcome.err;
  EXPECT_EQ(outcome.out, "");
  EXPECT_EQ(outcome.err, "oxmv: " + severity + ": " + clip.path() + ": " + message + "\n");
  EXPECT_TRUE(clip.isUntouched());
}

std::string lettersOf(const TagRow& row) {
  const auto characters = charactersOf(row.tag);
  return {characters.begin(), characters.end()};
}

// A value that no example has, as it is typed; and as it is got.
struct Sample {
  std::string typed, got;
};

Sample sampleFor(const TagRow& row) {
  switch (row.read) {
    case Read::text: return {"Z9y8", "Z9y8"};
    case Read::int32: return {"0x12345", "74565"};
    case Read::uint8: return {"77", "77"};
    case Read::uint16: return {"4321", "4321"};
    case Read::float32: return {"-2.5", "-2.5"};
    case Read::integers: return {"4711", "4711"};
    case Read::data: return {"0a0b0c", "0a0b0c"};
    case Read::guid:
      return {"00112233445566778899AABBCCDDEEFF", "00112233445566778899aabbccddeeff"};
    case Read::nested: return {R"({"TILT":9.5})", R"({"TILT":9.5})"};
    case Read::nestedList: return {R"({"TILT":9.5})", R"([{"TILT":9.5}])"};
    case Read::controlPoint:
      return {R"({"TILT":9.5,"CTLPData":[3,4]})", R"([{"TILT":9.5,"CTLPData":[3,4]}])"};
    case Read::floats: {
      Sample sample;
      for (int i = 1; i <= row.count; ++i) {
        sample.typed += (i == 1 ? "" : ",") + std::to_string(i) + ".5";
        sample.got += (i == 1 ? "" : " ") + std::to_string(i) + ".5";
      }
      return sample;
    }
    default: ADD_FAILURE() << lettersOf(row); return {};
  }
}

bool isSimple(const TagRow& row) {
  return row.read != Read::nested && row.read != Read::nestedList &&
         row.read != Read::controlPoint && row.read != Read::data && row.read != Read::guid;
}

// That only this tag has changed, and that `show` has it.
void expectOnly(const EditedClip& clip, const TagRow& row, const Sample& sample) {
  const std::string tag = lettersOf(row);
  EXPECT_EQ(valueOf(clip.path(), tag), sample.got + '\n') << tag;
  Words own = {tag};
  if (row.read == Read::controlPoint) own.push_back(std::string(4, '\0'));
  EXPECT_EQ(recordsOf(clip.content(), own), recordsOf(clip.original(), own)) << tag;
  bool isShown = false;
  for (const std::string& line : linesOf(run({"show", clip.path()}).out)) {
    isShown = isShown ||
              (line.starts_with(tag + ' ') && (!isSimple(row) || line.ends_with(' ' + sample.got)));
  }
  EXPECT_TRUE(isShown) << tag;
}

TEST(Set, ChangesEveryTagThatIsAcceptedByKeyAndNothingElse) {
  std::size_t count = 0;
  for (const TagRow& row : tagRows()) {
    if (row.accept == Accept::unknown) continue;
    const EditedClip clip;
    const Sample sample = sampleFor(row);
    const Outcome outcome = set(clip, {lettersOf(row) + '=' + sample.typed});
    EXPECT_EQ(outcome.exitCode, 0) << lettersOf(row);
    EXPECT_EQ(outcome.out + outcome.err, "");
    expectOnly(clip, row, sample);
    ++count;
  }
  EXPECT_EQ(count, 188u);
}

TEST(Set, ChangesEveryTagByItsLabel) {
  std::size_t count = 0;
  for (const TagRow& row : tagRows()) {
    if (row.label.empty() || row.read == Read::none) continue;
    const EditedClip clip;
    const Sample sample = sampleFor(row);
    const Outcome outcome = set(clip, {std::string(row.label) + '=' + sample.typed});
    EXPECT_EQ(outcome.exitCode, 0) << row.label << outcome.err;
    expectOnly(clip, row, sample);
    ++count;
  }
  EXPECT_EQ(count, 45u);  // all but one, see below
}

TEST(Set, NamesTheTagThatIsMeantByTheOneThatIsNeverStored) {
  expectRefused({"Mark good take=1"}, "refused",
                "MKGD is a tag that is never stored; the tag that is stored is MRKG (unknown-tag);"
                " nothing written; oxmv tags says what is stored, and how");
  expectSet("MRKG=1", "MRKG", "1");
}

TEST(Set, ReadsIntegers) {
  expectSet("LCRC=0x1A2B3C4D", "LCRC", "439041101");
  expectSet("LCRC=-5", "LCRC", "-5");
  expectSet("LCRC=+5", "LCRC", "5");
  expectSet("LCRC=-0x10", "LCRC", "-16");
  expectSet("LCRC=0xDEADBEEF", "LCRC", "-559038737");
  expectSet("LCRC=2147483647", "LCRC", "2147483647");
  for (const std::string text : {"x", "", "1.5", "1,2", "0x", "0xg", "99999999999999999999", " 1"})
    expectRefused({"LCRC=" + text}, "error",
                  "LCRC needs an integer, got \"" + text + "\" (bad-value)");
}

TEST(Set, RefusesIntegersOutOfRange) {
  const auto expectRange = [](const std::string& tag, const std::string& number,
                              const std::string& back) {
    expectRefused({tag + '=' + number}, "refused",
                  tag + ' ' + number + " would come back as " + back +
                      " (int-range); nothing written; --allow int-range lets it through");
  };
  expectRange("LCRC", "3735928559", "-559038737");
  expectRange("TAKE", "70000", "4464");
  expectRange("TAKE", "-1", "65535");
  expectRange("CAMR", "256", "0");
}

TEST(Set, ReadsFloats) {
  expectSet("SATU=0.1", "SATU", "0.1");
  expectSet("SATU=1", "SATU", "1.0");
  expectSet("SATU=+1e-3", "SATU", "0.001");
  expectSet("SATU=inf", "SATU", "inf");
  for (const std::string text : {"x", "", "1,5", "1e99", "0x1"})
    expectRefused({"SATU=" + text}, "error",
                  "SATU needs a number, got \"" + text + "\" (bad-value)");
}

TEST(Set, ReadsListsOfNumbers) {
  expectSet("WBAL=1,1.3,1,1.5", "WBAL", "1.0 1.3 1.0 1.5");
  expectSet("WBAL= 1 , 1.3,1  1.5 ", "WBAL", "1.0 1.3 1.0 1.5");
  expectSet("WBAL=1.0 1.3 1.0 1.5", "WBAL", "1.0 1.3 1.0 1.5");
  expectSet("SCPg=7,8 0x9", "SCPg", "7 8 9");
  expectRefused({"WBAL=1,1.2,1"}, "error",
                "WBAL needs 4 numbers, got 3 (1.0 1.2 1.0) (list-count)");
  expectRefused({"WBAL="}, "error", "WBAL needs 4 numbers, got 0 (list-count)");
  expectRefused({"WBAL=1,,2,3"}, "error", "WBAL needs 4 numbers, got \"\" (bad-value)");
  expectRefused({"WBAL=1,2,3,"}, "error", "WBAL needs 4 numbers, got \"\" (bad-value)");
  expectRefused({"GPST=1,2"}, "refused",
                "GPST has 2 integers, which would all be written into the first (int-array);"
                " nothing written; --allow int-array lets it through");
}

TEST(Set, TakesTextAsItIs) {
  expectSet("NAME=a=b, 'c' \"d\" +: ", "NAME", "a=b, 'c' \"d\" +: ");
  expectRefused({"NAME="}, "refused",
                "NAME is empty and would not be written (text-empty); nothing written;"
                " oxmv unset removes it");
  expectRefused({"NAME=Caf\xC3\xA9"}, "refused",
                "NAME \"Caf\xC3\xA9\" would be written as zeros: only ASCII is stored"
                " (text-nonascii); nothing written; --allow text-nonascii lets it through");
  const EditedClip clip;
  EXPECT_NE(set(clip, {"NAME=" + std::string(256, 'x')}).err.find("(text-long)"),
            std::string::npos);
  expectSet("DTAG=AB", "DTAG", "AB");
}

TEST(Set, ReadsData) {
  expectSet("FREE=00fF10", "FREE", "00ff10");
  for (const std::string text : {"0", "0g", "00 11", "0x00"})
    expectRefused(
        {"FREE=" + text}, "error",
        "FREE needs hexadecimal digits, two for each byte, got \"" + text + "\" (bad-value)");
  expectRefused({"GUID=0011"}, "error", "GUID needs 16 bytes, got 2 (guid-length)");
  expectRefused({R"(GUID:={"$data":"0011"})"}, "refused",
                "GUID has 2 bytes and would be stored as if it had 16 (guid-length);"
                " nothing written; --layout readable avoids it");
}

TEST(Set, ChangesNestedTagsAndEntriesOfGroups) {
  expectSet("COL1/WBAL=1,2,3,4", "COL1/WBAL", "1.0 2.0 3.0 4.0");
  expectSet("COL1/White balance=1,2,3,4", "COL1/WBAL", "1.0 2.0 3.0 4.0");
  expectSet("COL2/COL1/REEL=x", "COL2/COL1/REEL", "x");
  expectSet("TAG/ISO=1600", "TAG/ISO", "1600");
  expectSet("TAG /Lens cap=on", "TAG/Lens cap", "on");
  expectSet("REG/Frames=12", "REG/Frames", "12");
}

TEST(Set, MakesEntriesIntegersOnlyIfNothingIsLost) {
  const EditedClip clip("groups-and-lists.colr");
  EXPECT_EQ(
      set(clip, {"TAG/a=12", "TAG/b=012", "TAG/c=-3", "TAG/d=4294967296", "TAG/Lens=50"}).exitCode,
      0);
  EXPECT_EQ(valueOf(clip.path(), "TAG"),
            R"({"ISO":400,"Lens":"50","Filter":"ND6","Height":140,"a":12,"b":"012","c":-3,)"
            R"("d":"4294967296"})"
            "\n");
  EXPECT_NE(set(clip, {"REG/a=text"})
                .err.find("(reg-text); nothing written; entries of \"TAG \" take texts\n"),
            std::string::npos);
}

TEST(Set, KeepsTheKindOfAnEntry) {
  const EditedClip clip("groups-and-lists.colr");
  EXPECT_EQ(
      set(clip, {"TAG/ISO=1.5"}).err,
      "oxmv: error: " + clip.path() +
          ": TAG /ISO needs an integer, got \"1.5\"; := takes a text in quotes (bad-value)\n");
  EXPECT_EQ(set(clip, {"TAG/ISO=5000000000"}).exitCode, 4);
  EXPECT_EQ(set(clip, {R"(TAG/ISO:="1.5")"}).exitCode, 0);
  EXPECT_EQ(valueOf(clip.path(), "TAG/ISO"), "1.5\n");
}

TEST(Set, TakesOneSignAtMost) {
  expectSet("SATU=+0.5", "SATU", "0.5");
  expectSet("TAKE=+5", "TAKE", "5");
  expectRefused({"SATU=+-5"}, "error", "SATU needs a number, got \"+-5\" (bad-value)");
  expectRefused({"TAKE=+-5"}, "error", "TAKE needs an integer, got \"+-5\" (bad-value)");
}

TEST(Set, LeavesFilesThatAreNoClipsAlone) {
  const TempDir folder;
  const std::string file = (folder / "notes.txt").string();
  for (const std::string content : {"abc", "These are notes, and no clip at all.\n"}) {
    writeFile(file, std::vector<std::uint8_t>(content.begin(), content.end()));
    const std::string original = readFile(file);
    const Outcome outcome = run({"set", file, "REEL=A"});
    EXPECT_EQ(outcome.exitCode, 4);
    EXPECT_EQ(outcome.err, "oxmv: refused: " + file +
                               ": there is no tag in it: is it a clip? (no-tags); nothing written;"
                               " oxmv encode makes a new one in its place\n");
    EXPECT_EQ(readFile(file), original);
  }
}

TEST(Set, ChangesEntriesInRegWhoseNamesEndWithNuls) {
  const EditedClip clip;
  EXPECT_EQ(set(clip, {"REG/Frames=12"}).exitCode, 0);
  EXPECT_EQ(set(clip, {"REG/Frames=13"}).exitCode, 0);
  EXPECT_EQ(valueOf(clip.path(), "REG"), "{\"Frames\\u0000\\u0000\":13}\n");
}

TEST(Set, FillsTheRecordsOfListTexts) {
  const EditedClip clip("walk.colr");
  const Outcome outcome = set(clip, {"KWRd+=night", "KWRd+=wide", "CMId=left", "LOCn=pier"});
  EXPECT_EQ(outcome.exitCode, 0) << outcome.err;
  EXPECT_EQ(outcome.err, "");
  EXPECT_EQ(run({"get", "--json", clip.path(), "KWRd"}).out.find("[\"day\\u0000\",\"night"),
            run({"get", "--json", clip.path(), "KWRd"}).out.find("[\"day"));
  EXPECT_EQ(valueOf(clip.path(), "KWRd"), "day\nnight\nwide\n");
  EXPECT_EQ(set(clip, {"KWRd=" + std::string(255, 'k')}).exitCode, 0);
  EXPECT_EQ(valueOf(clip.path(), "KWRd"), std::string(255, 'k') + '\n');
  EXPECT_NE(set(clip, {"KWRd=" + std::string(256, 'k')}).err.find("(text-long)"),
            std::string::npos);
  EXPECT_EQ(set(clip, {"KWRd+=a, b"}).exitCode, 0);  // one text
  EXPECT_EQ(valueOf(clip.path(), "KWRd"), std::string(255, 'k') + "\na, b\n");
}

TEST(Set, AppendsToEveryKindOfList) {
  const EditedClip clip("groups-and-lists.colr");
  EXPECT_EQ(set(clip, {"SCPg+=16,17", R"(DSPm+={"TILT":1.0})"}).exitCode, 0);
  EXPECT_EQ(valueOf(clip.path(), "SCPg"), "12 14 15 16 17\n");
  EXPECT_EQ(valueOf(clip.path(), "DSPm"),
            "[{\"ZOOM\":2.0},{\"REEL\":\"A001_C007\"},{\"TILT\":1.0}]\n");
  const EditedClip points("control-points.colr");
  EXPECT_EQ(set(points, {R"(CTLp+={"SATU":1.0,"CTLPData":[60,20]})"}).exitCode, 0);
  EXPECT_NE(valueOf(points.path(), "CTLp").find("[48,20]},{\"SATU\":1.0,\"CTLPData\":[60,20]}]"),
            std::string::npos);
  EXPECT_EQ(run({"check", points.path()}).exitCode, 0);
}

TEST(Set, RefusesListsWithoutElements) {
  expectRefused({"SCPg="}, "refused",
                "SCPg has no elements and would leave no record (list-empty); nothing written;"
                " oxmv unset removes it");
  expectRefused({"SCPg+="}, "refused",
                "SCPg has no elements and would leave no record (list-empty); nothing written");
}

TEST(Set, TakesTypedJson) {
  expectSet("REEL:=\"x\"", "REEL", "x");
  expectSet("SATU:=2.0", "SATU", "2.0");
  expectSet("KWRd:=[\"aaaa\",\"bbbb\"]", "KWRd", "aaaa\nbbbb");
  expectSet("FREE:={\"$data\":\"0102\"}", "FREE", "0102");
  expectSet("SATU:={\"$float\":\"0x7fc00000\"}", "SATU", "nan");
  expectSet("TAG:={\"ISO\":5}", "TAG", "{\"ISO\":5}");
  expectSet("TAG/Roll:=\"5\"", "TAG/Roll", "5");
  expectSet("DTAG:=\"ABCD\"", "DTAG", "ABCD");
  expectSet("COL1:={\"SATU\":0.25,\"COL1\":{\"TAKE\":1}}", "COL1",
            "{\"SATU\":0.25,\"COL1\":{\"TAKE\":1}}");
}

TEST(Set, RefusesJsonThatDoesNotFit) {
  expectRefused({"SATU:=1"}, "refused",
                "SATU is an integer, and would come back as a float (wrong-kind); nothing written;"
                " --allow wrong-kind lets it through");
  expectRefused({"TAKE:=\"x\"", "--allow", "wrong-kind"}, "error",
                "TAKE takes a number, got x (not-accepted)");
  expectRefused({"WBAL:=[1.0,2.0]"}, "error",
                "WBAL takes an array of 4, got 1.0 2.0 (not-accepted)");
  expectRefused({"WBAL:=5"}, "error", "WBAL takes an array of 4, got 5 (not-accepted)");
  expectRefused({"KWRd:=[\"day\"]"}, "refused",
                "KWRd[0] \"day\" would gain a NUL at its end (list-pads); nothing written;"
                " --allow list-pads lets it through");
  expectRefused({"COL1:={\"DTIN\":1}"}, "refused",
                "COL1/DTDR would come into being as 0, because DTIN is there (pair-added);"
                " nothing written; --allow pair-added lets it through");
  expectRefused({"REEL:=null"}, "error",
                "REEL needs tag JSON; column 1: null has no place in a dictionary (json-literal)");
  expectRefused({"REEL:=\"a\",\"TAKE\":1"}, "error",
                "REEL needs tag JSON; column 4: more text behind the value (json-trailing-text)");
  expectRefused({"COL1:={\"A\":1,\n\"A\":2}"}, "error",
                "COL1 needs tag JSON; line 2, column 1: member \"A\" stands twice"
                " (json-duplicate)");
  expectRefused({"COL1=x"}, "error",
                "COL1 needs tag JSON; column 1: invalid literal (json-syntax)");
}

TEST(Set, AddsNoOtherOneOfAPair) {
  const EditedClip clip("walk.colr");
  EXPECT_EQ(set(clip, {"DTIN=5", "COL1/DTFO=6"}).err, "");
  EXPECT_EQ(run({"get", clip.path(), "DTDR"}).exitCode, 1);
  EXPECT_EQ(run({"get", clip.path(), "COL1/DTFI"}).exitCode, 1);
}

TEST(Set, LetsThroughWhatIsAllowedAndWarns) {
  const EditedClip clip;
  const Outcome outcome = set(
      clip, {"TAKE=70000", "NAME=Caf\xC3\xA9", "--allow", "int-range", "--allow=text-nonascii"});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_EQ(outcome.err,
            "oxmv: warning: " + clip.path() + ": TAKE 70000 would come back as 4464 (int-range)\n" +
                "oxmv: warning: " + clip.path() +
                ": NAME \"Caf\xC3\xA9\" would be written as zeros: only ASCII is stored"
                " (text-nonascii)\n");
  EXPECT_EQ(valueOf(clip.path(), "TAKE"), "4464\n");
  EXPECT_EQ(set(clip, {"KWRd:=[\"day\"]", "--allow", "list-pads"}).exitCode, 0);
  EXPECT_EQ(valueOf(clip.path(), "KWRd"), "day\n");
}

TEST(Set, PromisesNothingThatAllowWouldNotDo) {
  const auto said = [](const std::string& word) {
    const EditedClip clip;
    return set(clip, {word}).err;
  };
  EXPECT_TRUE(
      said("GHTL=5").ends_with("; nothing written; oxmv tags says what is stored, and how\n"));
  EXPECT_TRUE(said("REG/a=b").ends_with("; nothing written; entries of \"TAG \" take texts\n"));
  const EditedClip clip;
  const Outcome outcome = set(clip, {"MKGD=1", "--allow", "unknown-tag"});
  EXPECT_EQ(outcome.exitCode, 4);
  EXPECT_TRUE(
      outcome.err.ends_with(": MKGD: nothing would be stored (not-stored);"
                            " nothing written\n"))
      << outcome.err;
}

TEST(Set, EncodesInTheLayoutThatIsAskedFor) {
  const EditedClip clip;
  const std::string two = R"(GUID:={"$data":"0011"})";
  EXPECT_EQ(set(clip, {two, "--layout", "exact"}).exitCode, 4);
  EXPECT_EQ(set(clip, {two, "--layout", "readable"}).exitCode, 0);
  EXPECT_EQ(valueOf(clip.path(), "GUID"), "0011\n");
  EXPECT_EQ(set(clip, {two, "--layout", "tidy"}).exitCode, 2);
}

TEST(Set, MakesAllAssignmentsOrNone) {
  const EditedClip clip;
  const Outcome outcome = set(clip, {"REEL=x", "TAKE=70000", "SATU=y", "NAME=z"});
  EXPECT_EQ(outcome.exitCode, 4);
  EXPECT_EQ(linesOf(outcome.err).size(), 2u) << outcome.err;
  EXPECT_TRUE(clip.isUntouched());
  EXPECT_EQ(set(clip, {"REEL=x", "REEL=y", "NAME=z"}).exitCode, 0);
  EXPECT_EQ(run({"get", clip.path(), "REEL", "NAME"}).out, "y\nz\n");
}

TEST(Set, ShowsOldAndNewOnADryRun) {
  const EditedClip clip("walk.colr");
  const Outcome outcome = set(
      clip, {"-n", "REEL=A002", "KWRd+=night", "TAG/ISO=500", "TAKE=3", "COL1/TILT=1", "REG/x=1"});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_EQ(outcome.out,
            "REEL: A001 -> A002\n"
            "KWRd[1]: (absent) -> night (+3 NUL)\n"
            "TAG /ISO: 400 -> 500\n"
            "COL1/TILT: (absent) -> 1.0\n"
            "REG /x (+3 NUL): (absent) -> 1\n");
  EXPECT_EQ(outcome.err, "");
  EXPECT_TRUE(clip.isUntouched());
  EXPECT_EQ(set(clip, {"--dry-run", "TAKE=70000"}).exitCode, 4);
  EXPECT_EQ(set(clip, {"--dry-run", "TAKE=70000"}).out, "");
}

TEST(Set, WritesNothingWhenTheValueIsThereAlready) {
  const EditedClip clip("walk.colr");
  struct stat before = {};
  ASSERT_EQ(::stat(clip.path().c_str(), &before), 0);
  const Outcome outcome = set(clip, {"-v", "--backup", "REEL=A001", "WBAL=1,1.25,1,1.5"});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_EQ(outcome.err, "oxmv: note: " + clip.path() + ": nothing to change\n");
  struct stat after = {};
  ASSERT_EQ(::stat(clip.path().c_str(), &after), 0);
  EXPECT_EQ(after.st_ino, before.st_ino);
  EXPECT_EQ(clip.files(), 1);
}

TEST(Set, NotesWhatItChangedWhenVerbose) {
  const EditedClip clip("walk.colr");
  EXPECT_EQ(set(clip, {"-v", "REEL=A002"}).err,
            "oxmv: note: " + clip.path() + ": REEL: A001 -> A002\n" + "oxmv: note: " + clip.path() +
                ": got 128 bytes\n");
}

TEST(Set, KeepsTheOldFileAndEveryOlderOne) {
  const EditedClip clip("walk.colr");
  ASSERT_EQ(::chmod(clip.path().c_str(), 0640), 0);
  EXPECT_EQ(set(clip, {"--backup", "REEL=A002"}).err, "");
  EXPECT_EQ(readFile(clip.path() + '~'), clip.original());
  struct stat status = {};
  ASSERT_EQ(::stat((clip.path() + '~').c_str(), &status), 0);
  EXPECT_EQ(status.st_mode & 07777, 0640u);
  const std::string second = clip.content();
  const Outcome outcome = set(clip, {"--backup", "-v", "REEL=A003"});
  EXPECT_NE(outcome.err.find(": the old file is " + clip.path() + "~2\n"), std::string::npos);
  EXPECT_EQ(readFile(clip.path() + '~'), clip.original());
  EXPECT_EQ(readFile(clip.path() + "~2"), second);
  EXPECT_EQ(clip.files(), 3);
}

TEST(Set, MakesAClipThatDoesNotExistOnlyWhenAsked) {
  const TempDir folder;
  const std::string made = (folder / "made.colr").string();
  const Outcome missing = run({"set", made, "REEL=x"});
  EXPECT_EQ(missing.exitCode, 3);
  EXPECT_EQ(missing.err,
            "oxmv: error: " + made + ": No such file or directory; --create makes it (missing)\n");
  EXPECT_EQ(run({"set", "--create", "-n", made, "REEL=x"}).out, "REEL: (absent) -> x\n");
  EXPECT_FALSE(std::filesystem::exists(made));
  EXPECT_EQ(run({"set", "--create", "--backup", made, "REEL=x"}).exitCode, 0);
  EXPECT_EQ(readFile(made), std::string("REEL\4\0\0cx\0\0\0", 12));
  EXPECT_EQ(run({"set", "--create", made, "TAKE=1"}).exitCode, 0);
  EXPECT_EQ(run({"get", made, "REEL", "TAKE"}).out, "x\n1\n");
  EXPECT_EQ(run({"set", "--create", folder / "no/such.colr", "REEL=x"}).exitCode, 3);
}

TEST(Set, ReadsStandardInputAndWritesStandardOutput) {
  const EditedClip clip("walk.colr");
  EXPECT_EQ(set(clip, {"REEL=A002"}).exitCode, 0);
  EXPECT_EQ(run({"set", "-", "REEL=A002"}, clip.original()).out, clip.content());
  EXPECT_EQ(run({"set", "-", "REEL=A001"}, clip.original()).out, clip.original());
  EXPECT_EQ(run({"set", "-", "TAKE=1"}, "").exitCode, 0);
  EXPECT_EQ(run({"set", "-", "TAKE=x"}, clip.original()).out, "");
  EXPECT_EQ(run({"set", "-", "-n", "REEL=x"}, clip.original()).out, "REEL: A001 -> x\n");
  const Outcome terminal = runOnTerminal({"set", "-", "REEL=x", "--color", "never"});
  EXPECT_EQ(terminal.exitCode, 4);
  EXPECT_EQ(terminal.out,
            "oxmv: refused: standard output: a clip is binary, and this is a terminal"
            " (binary-to-terminal)\n");
  EXPECT_EQ(run({"set", "-", "--backup", "REEL=x"}).err,
            "oxmv: error: --backup needs a file (bad-flags)\n");
}

TEST(Set, KeepsPermissionsAndSymbolicLinks) {
  const EditedClip clip("walk.colr");
  ASSERT_EQ(::chmod(clip.path().c_str(), 0604), 0);
  const std::string link = (clip.folder() / "link").string();
  std::filesystem::create_symlink("clip.colr", link);
  EXPECT_EQ(run({"set", link, "REEL=A002"}).exitCode, 0);
  EXPECT_TRUE(std::filesystem::is_symlink(link));
  EXPECT_EQ(valueOf(clip.path(), "REEL"), "A002\n");
  struct stat status = {};
  ASSERT_EQ(::stat(clip.path().c_str(), &status), 0);
  EXPECT_EQ(status.st_mode & 07777, 0604u);
}

TEST(Set, NamesWhatCannotBeReadOrWritten) {
  const EditedClip clip("walk.colr");
  EXPECT_EQ(run({"set", clip.folder(), "REEL=x"}).err,
            "oxmv: error: " + clip.folder().string() + ": Is a directory (not-a-file)\n");
  std::filesystem::permissions(clip.folder(), std::filesystem::perms(0555));
  std::filesystem::permissions(clip.path(), std::filesystem::perms(0644));
  // Root may write everywhere.
  const Outcome outcome = runShell(
      "run=\"$OXMV\"; [ \"$(id -u)\" = 0 ] && { command -v setpriv >/dev/null || exit 99; "
      "run=\"setpriv --reuid=65534 --regid=65534 --clear-groups $OXMV\"; }\n"
      "$run set " +
      clip.path() + " REEL=x; first=$?\n" + "$run set --backup " + clip.path() +
      " REEL=x && exit 1; exit $first");
  std::filesystem::permissions(clip.folder(), std::filesystem::perms(0755));
  if (outcome.exitCode == 99 || outcome.exitCode > 125) GTEST_SKIP() << outcome.err;
  EXPECT_EQ(outcome.exitCode, 3);
  EXPECT_EQ(outcome.err, "oxmv: error: " + clip.path() + ": Permission denied (write-failed)\n" +
                             "oxmv: error: " + clip.path() +
                             "~: Permission denied (write-failed)\n");
  EXPECT_TRUE(clip.isUntouched());
}

TEST(Set, LeavesNoBackupOfAFileThatItCouldNotReplace) {
  const EditedClip clip("walk.colr");
  const std::string text(200, 'x');
  std::string words;
  for (const char* tag : {"NAME", "LOGC", "DSCR", "LABR", "SCES", "REEA"})
    words += std::string(" ") + tag + "=" + text;
  const Outcome outcome =
      runShell("trap '' XFSZ; ulimit -f 1; exec \"$OXMV\" set --backup " + clip.path() + words);
  EXPECT_EQ(outcome.exitCode, 3);
  EXPECT_EQ(outcome.err, "oxmv: error: " + clip.path() + ": File too large (write-failed)\n");
  EXPECT_TRUE(clip.isUntouched());
}

// A file that is gone can still be read by whoever has it open.
TEST(Set, RefusesToWriteWhatIsNoLongerAsItWasRead) {
  const EditedClip clip("walk.colr");
  const Outcome outcome = runShell("cd " + clip.folder().string() +
                                   " && exec 0<clip.colr && rm clip.colr &&"
                                   " exec \"$OXMV\" set /dev/stdin REEL=A002");
  EXPECT_EQ(outcome.exitCode, 4);
  EXPECT_EQ(outcome.err,
            "oxmv: refused: /dev/stdin: another program has changed it meanwhile (file-changed);"
            " nothing written; try again\n");
  EXPECT_EQ(clip.files(), 0);
}

TEST(Set, RefusesToEditWhatReadersWouldNotFind) {
  const TempDir folder;
  const std::string clip = (folder / "clip.colr").string();
  writeFile(clip, StreamBuilder().header("REEL", 9000, 'c').raw({'A', '0', '0', '1'}).bytes());
  const std::string original = readFile(clip);
  const Outcome outcome = run({"set", clip, "NAME=x"});
  EXPECT_EQ(outcome.exitCode, 4);
  EXPECT_EQ(outcome.err, "oxmv: warning: " + clip +
                             ": byte 0: REEL claims 9000 bytes, 4 are there (incomplete-record)\n"
                             "oxmv: refused: " +
                             clip +
                             ": NAME at byte 12: readers would not find the change there, or would"
                             " lose something else (damaged-stream); nothing written; oxmv check"
                             " says what is wrong with the clip\n");
  EXPECT_EQ(readFile(clip), original);
}

TEST(Set, RefusesAPathOfMoreLevelsThanStreamsHave) {
  const EditedClip clip("walk.colr");
  std::string word;
  for (int i = 0; i < 20'000; ++i) word += "COL1/";
  word += "PRCS=1";
  const Outcome outcome = run({"set", clip.path(), word});
  EXPECT_EQ(outcome.exitCode, 4);
  EXPECT_TRUE(outcome.err.ends_with(
      "COL1 is nested deeper than 64 levels (too-deep); nothing written; oxmv tags says what is"
      " stored, and how\n"));
  const Outcome allowed = run({"set", "--allow", "too-deep", clip.path(), word});
  EXPECT_EQ(allowed.exitCode, 4);
  EXPECT_TRUE(
      allowed.err.ends_with("PRCS: no stream is read so deep (too-deep); nothing written\n"));
  EXPECT_TRUE(clip.isUntouched());
}

TEST(Set, LeavesDamageWhereItIs) {
  const TempDir folder;
  const std::string clip = (folder / "clip.colr").string();
  const std::string damaged = readFile(OXMV_TEST_DATA "/streams/truncated-second-record.bin");
  writeFile(clip, damaged);
  EXPECT_EQ(run({"set", clip, "SATU=7"}).exitCode, 0);
  EXPECT_EQ(readFile(clip), damaged.substr(0, 12) + std::string("SATU\4\0\0f\0\0\xE0\x40", 12) +
                                damaged.substr(12));
}

TEST(Set, RefusesWrongUse) {
  const EditedClip clip("walk.colr");
  const auto errorOf = [&](const Words& words) {
    const Outcome outcome = set(clip, words);
    EXPECT_EQ(outcome.exitCode, 2);
    EXPECT_EQ(outcome.out, "");
    return outcome.err;
  };
  EXPECT_EQ(errorOf({}), "oxmv: error: set needs CLIP TAG=VALUE... (missing-words)\n");
  EXPECT_EQ(errorOf({"REEL"}),
            "oxmv: error: \"REEL\" assigns nothing; write TAG=VALUE (bad-assignment)\n");
  EXPECT_EQ(errorOf({"TAKE=1", "RELE=x"}),
            "oxmv: error: no tag \"RELE\"; did you mean REEL (Reel name)? (unknown-tag)\n");
  EXPECT_EQ(errorOf({"WBAL+=1"}),
            "oxmv: error: WBAL is no list to append to; write WBAL=VALUE (bad-assignment)\n");
  EXPECT_EQ(errorOf({"TAG/ISO+=1"}),
            "oxmv: error: TAG /ISO is no list to append to; write TAG /ISO=VALUE"
            " (bad-assignment)\n");
  EXPECT_EQ(errorOf({"REEL/x=1"}),
            "oxmv: error: \"REEL/x\": REEL holds no other tags (bad-path)\n");
  EXPECT_EQ(errorOf({"REEL=x", "--allow", "all"}),
            "oxmv: error: --allow knows no code \"all\"; a refusal names it (bad-value)\n");
  EXPECT_EQ(errorOf({"REEL=x", "--json"}),
            "oxmv: error: set takes no --json; see oxmv help set (bad-flags)\n");
  EXPECT_TRUE(clip.isUntouched());
}

}  // namespace
}  // namespace oxmv::cli::test
