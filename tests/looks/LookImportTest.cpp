#include <fstream>
#include <iterator>
#include <map>
#include <random>
#include <string>
#include <vector>

#include <gtest/gtest.h>
#include <nlohmann/json.hpp>
#include <sys/stat.h>

#include "oxmv/looks/Crc32.h"
#include "oxmv/looks/LookImport.h"
#include "oxmv/looks/LookTableFile.h"
#include "support/FakeHost.h"
#include "support/TempDir.h"
#include "support/TestData.h"

namespace oxmv {
namespace {

namespace fs = std::filesystem;
using test::Bytes;
using test::TempDir;
using Copy = LookTableReport::Copy;

void put(const fs::path& path, std::string_view content) {
  std::ofstream(path, std::ios::binary) << content;
}

std::string get(const fs::path& path) {
  std::ifstream file(path, std::ios::binary);
  return {std::istreambuf_iterator<char>(file), {}};
}

// Keeps what an import reports.
class Witness final : public LookImportObserver {
 public:
  std::vector<LookTableReport> tables;
  std::vector<LookImportEnd> stops;
  std::string what;

  void onTable(const LookTableReport& table) override {
    tables.push_back(table);
    tables.back().node.text = {};  // gone after the call
  }
  void onStop(const LookImportEnd& end) override {
    what = end.what;
    stops.push_back(end);
    stops.back().what = {};
  }
};

class LookImport : public testing::Test {
 protected:
  LookImport() {
    fs::create_directory(looks);
    host->strings["OXMVLutsPath"] = looks;
  }

  std::optional<LookFileRef> import(std::string_view description,
                                    const std::string& name = "Warm.xml") {
    put(folder / name, description);
    witness = {};
    const auto look = LookFileRef::initFromLookFile(folder / name, &witness);
    EXPECT_EQ(host->alerts.size(), look ? 0u : 1u);
    return look;
  }

  // The names of the files in the look-table folder, and what is in them.
  std::map<std::string, std::string> files() const {
    std::map<std::string, std::string> found;
    for (const auto& entry : fs::directory_iterator(looks)) {
      found[entry.path().filename()] = get(entry.path());
    }
    return found;
  }

  void expectEmpty(const std::optional<LookFileRef>& look) {
    ASSERT_TRUE(look);
    EXPECT_EQ(look->CRC(), 0u);
    EXPECT_EQ(look->version(), 0);
    EXPECT_EQ(look->displayName(), std::nullopt);
  }

  TempDir folder;
  const fs::path looks = folder / "looks";
  test::InstalledFakeHost host;
  Witness witness;
};

const std::string onePoint =
    "<look><LUT><size>1</size><a>0000803F0000003F0000803E</a></LUT></look>";

std::uint32_t crcOf(const std::string& bytes) {
  return calccrc(reinterpret_cast<const std::uint8_t*>(bytes.data()),
                 static_cast<std::ptrdiff_t>(bytes.size()));
}

TEST_F(LookImport, WritesTheTableAndCopiesTheDescription) {
  const auto look = import(onePoint);
  ASSERT_TRUE(look);
  EXPECT_EQ(look->CRC(), 0xB5CB6ADAu);
  EXPECT_EQ(look->version(), 2);
  EXPECT_EQ(look->displayName(), "Warm");
  const std::string file =
      std::string("OXLK\x02\0\0\0\x40\0\0\0\x01\0\0\0\x01\x5A\x01\0\x0A\x16\x02\0Warm", 28) +
      std::string(36, '\0') + std::string("\0\0\x80\x3F\0\0\0\x3F\0\0\x80\x3E", 12);
  EXPECT_EQ(files(), (std::map<std::string, std::string>{{"B5CB6ADA.oxlook", file},
                                                         {"Warm.xml", onePoint}}));

  ASSERT_EQ(witness.tables.size(), 1u);
  const LookTableReport& table = witness.tables[0];
  EXPECT_EQ(table.size, 1);
  EXPECT_EQ(table.values.groups, 3u);
  EXPECT_EQ(table.missing(), 0u);
  EXPECT_EQ(table.surplus(), 0u);
  EXPECT_EQ(table.values.malformed, 0u);
  EXPECT_EQ(table.crc, 0xB5CB6ADAu);
  EXPECT_TRUE(table.isNew);
  EXPECT_FALSE(table.writeError);
  EXPECT_EQ(table.copy, Copy::copied);
  EXPECT_TRUE(witness.stops.empty());
}

TEST_F(LookImport, KeepsWhatIsThereTheSecondTimeAndGivesTheEmptyReference) {
  import(onePoint);
  const auto before = files();
  struct stat old = {};
  ASSERT_EQ(::stat((looks / "B5CB6ADA.oxlook").c_str(), &old), 0);
  fs::remove(looks / "Warm.xml");

  expectEmpty(import(onePoint));
  struct stat now = {};
  ASSERT_EQ(::stat((looks / "B5CB6ADA.oxlook").c_str(), &now), 0);
  EXPECT_EQ(now.st_ino, old.st_ino);
  EXPECT_EQ(now.st_mtim.tv_nsec, old.st_mtim.tv_nsec);
  EXPECT_FALSE(fs::exists(looks / "Warm.xml"));  // not copied either
  EXPECT_EQ(files().at("B5CB6ADA.oxlook"), before.at("B5CB6ADA.oxlook"));
  ASSERT_EQ(witness.tables.size(), 1u);
  EXPECT_FALSE(witness.tables[0].isNew);
  EXPECT_EQ(witness.tables[0].copy, Copy::notTried);
}

TEST_F(LookImport, ReplacesAFileOfAnotherVersion) {
  put(looks / "B5CB6ADA.oxlook", std::string("OXLK\x01\0\0\0", 8));
  EXPECT_EQ(import(onePoint)->CRC(), 0xB5CB6ADAu);
  EXPECT_EQ(files().at("B5CB6ADA.oxlook").size(), 76u);
  EXPECT_EQ(files().at("B5CB6ADA.oxlook")[4], 2);
}

TEST_F(LookImport, LeavesAFileOfTheDescriptionsNameAlone) {
  put(looks / "Warm.xml", "mine");
  EXPECT_TRUE(import(onePoint)->displayName());
  EXPECT_EQ(files().at("Warm.xml"), "mine");
  EXPECT_EQ(witness.tables.at(0).copy, Copy::alreadyThere);
}

TEST_F(LookImport, DescriptionMayLieInTheFolderItself) {
  put(looks / "Warm.xml", onePoint);
  const auto look = LookFileRef::initFromLookFile(looks / "Warm.xml");
  EXPECT_EQ(look->CRC(), 0xB5CB6ADAu);
  EXPECT_EQ(files().at("Warm.xml"), onePoint);
}

TEST_F(LookImport, ValuesInQuotationMarksAreTheValues) {
  import("<look><LUT><size>\"1\"</size><a>\"0000803F0000003F\"</a></LUT></look>");
  EXPECT_EQ(witness.tables.at(0).values.groups, 2u);
  EXPECT_EQ(witness.tables.at(0).missing(), 1u);
}

TEST_F(LookImport, MissingValuesAreZeroAndNotInTheCrc) {
  const auto look = import("<look><LUT><size>2</size><a>0000803F0000003F</a></LUT></look>");
  const std::string values("\0\0\x80\x3F\0\0\0\x3F", 8);
  EXPECT_EQ(look->CRC(), crcOf(values));
  const std::string file = files().at(lookFileNameOf(look->CRC()));
  EXPECT_EQ(file.substr(64), values + std::string(88, '\0'));
  EXPECT_EQ(witness.tables.at(0).missing(), 22u);
}

TEST_F(LookImport, SurplusValuesAreDroppedAndNotInTheCrc) {
  const auto look =
      import("<look><LUT><size>1</size><a>0000803F0000003F0000803E0000003E</a></LUT></look>");
  EXPECT_EQ(look->CRC(), 0xB5CB6ADAu);
  EXPECT_EQ(files().at("B5CB6ADA.oxlook").size(), 76u);
  EXPECT_EQ(witness.tables.at(0).surplus(), 1u);
}

TEST_F(LookImport, TableAfterALargerOneHasNothingOfIt) {
  const std::string values(8 * 81, 'F');
  import("<look><LUT><size>3</size><a>" + values +
         "</a><size>2</size><b>0000803F</b></LUT></look>");
  ASSERT_EQ(witness.tables.size(), 2u);
  const std::string file = files().at(lookFileNameOf(witness.tables[1].crc));
  EXPECT_EQ(file.substr(64), std::string("\0\0\x80\x3F", 4) + std::string(92, '\0'));
}

TEST_F(LookImport, MalformedGroupIsZeroAndReported) {
  import("<look><LUT><size>1</size><a>0000803F 0000zz3F 0000803E</a></LUT></look>");
  const LookTableReport& table = witness.tables.at(0);
  EXPECT_EQ(table.values.malformed, 1u);
  EXPECT_EQ(table.node.textOffset.value() + table.values.firstMalformed, 37u);
  EXPECT_EQ(files().at(lookFileNameOf(table.crc)).substr(64),
            std::string("\0\0\x80\x3F\0\0\0\0\0\0\x80\x3E", 12));
}

TEST_F(LookImport, TextsThatAreOddAreReadAndReported) {
  import(
      "<look><LUT><size>1</size><a>\n    0000803F\u00E9 0000003F</a><b>12345678</b></LUT></look>");
  EXPECT_EQ(witness.tables.at(0).values.groups, 2u);
  EXPECT_GT(witness.tables.at(0).values.leading, maxLeading);
  EXPECT_FALSE(witness.tables.at(0).values.isAscii);
  EXPECT_EQ(witness.tables.at(1).values.leading, 0u);
  EXPECT_TRUE(witness.tables.at(1).values.isAscii);
}

TEST_F(LookImport, EncodingsAreRead) {
  const auto expected = import(onePoint)->CRC();
  std::string utf16 = "\xFF\xFE";
  for (const char c : onePoint) (utf16 += c) += '\0';
  for (const std::string& file :
       {"\xEF\xBB\xBF" + onePoint, utf16,
        "<?xml version='1.0' encoding='ISO-8859-1'?><!--\xE9-->" + onePoint}) {
    fs::remove_all(looks);
    fs::create_directory(looks);
    EXPECT_EQ(import(file)->CRC(), expected);
    EXPECT_EQ(files().at("Warm.xml"), file);
  }
}

TEST_F(LookImport, WhiteSpaceAfterTheSizeIsATableWithoutValues) {
  const auto look = import("<look><LUT><size>1</size> </LUT></look>");
  EXPECT_EQ(look->CRC(), 0u);
  EXPECT_EQ(look->version(), 2);
  EXPECT_EQ(files().at("00000000.oxlook").substr(64), std::string(12, '\0'));
}

TEST_F(LookImport, EveryTableIsAFileAndTheLastIsTheAnswer) {
  const auto look = import(
      "<look><LUT><size>1</size><a>0000803F</a><b>0000003F</b></LUT>"
      "<LUT><size>1</size><!--0000803E--></LUT></look>");
  ASSERT_EQ(witness.tables.size(), 3u);
  EXPECT_EQ(look->CRC(), witness.tables[2].crc);
  EXPECT_EQ(files().size(), 4u);
  EXPECT_EQ(witness.tables[0].copy, Copy::copied);
  EXPECT_EQ(witness.tables[1].copy, Copy::alreadyThere);
}

TEST_F(LookImport, TheLastWrittenIsTheAnswerAlsoBeforeOneThatIsThere) {
  import(onePoint);
  const auto look = import(
      "<look><LUT><size>1</size><a>0000803F</a><b>0000803F0000003F0000803E</b></LUT></look>");
  EXPECT_EQ(look->CRC(), witness.tables.at(0).crc);
  EXPECT_FALSE(witness.tables.at(1).isNew);
}

TEST_F(LookImport, TableThatIsThereTwiceIsWrittenOnce) {
  const auto look =
      import("<look><LUT><size>1</size><a>0000803F</a><b>0000003F</b><c>0000803F</c></LUT></look>");
  ASSERT_EQ(witness.tables.size(), 3u);
  EXPECT_FALSE(witness.tables[2].isNew);
  EXPECT_EQ(witness.tables[2].copy, Copy::notTried);
  EXPECT_EQ(look->CRC(), witness.tables[1].crc);
}

TEST_F(LookImport, TableThatCouldNotBeWrittenIsNotTriedAgain) {
  // The folder comes while the tables are told, too late for the first and all like it.
  class Maker final : public LookImportObserver {
   public:
    Maker(fs::path folder, LookImportObserver& next) : folder_(std::move(folder)), next_(next) {}
    void onTable(const LookTableReport& table) override {
      fs::create_directory(folder_);
      next_.onTable(table);
    }

   private:
    fs::path folder_;
    LookImportObserver& next_;
  };
  const fs::path late = folder / "late";
  host->strings["OXMVLutsPath"] = late;
  put(folder / "Warm.xml",
      "<look><LUT><size>1</size><a>0000803F</a><b>0000003F</b><c>0000803F</c></LUT></look>");
  Maker maker(late, witness);
  const auto look = LookFileRef::initFromLookFile(folder / "Warm.xml", &maker);
  ASSERT_EQ(witness.tables.size(), 3u);
  EXPECT_EQ(witness.tables[0].writeError, std::errc::no_such_file_or_directory);
  EXPECT_FALSE(witness.tables[1].writeError);
  EXPECT_TRUE(witness.tables[2].isNew);
  EXPECT_EQ(witness.tables[2].writeError, witness.tables[0].writeError);
  EXPECT_FALSE(fs::exists(late / lookFileNameOf(witness.tables[0].crc)));
  EXPECT_TRUE(fs::exists(late / lookFileNameOf(witness.tables[1].crc)));
  EXPECT_EQ(look->CRC(), witness.tables[2].crc);  // as if it had been tried
  EXPECT_EQ(look->version(), 2);
  for (const LookTableReport& table : witness.tables) {
    EXPECT_EQ(table.copy, Copy::failed);
    EXPECT_EQ(table.copyError, std::errc::no_such_file_or_directory);
  }
  EXPECT_FALSE(fs::exists(late / "Warm.xml"));
}

TEST_F(LookImport, TableThatIsThereIsNotLookedForAgain) {
  // The files go while the tables are told.
  class Remover final : public LookImportObserver {
   public:
    Remover(fs::path folder, LookImportObserver& next) : folder_(std::move(folder)), next_(next) {}
    void onTable(const LookTableReport& table) override {
      fs::remove(folder_ / lookFileNameOf(table.crc));
      next_.onTable(table);
    }

   private:
    fs::path folder_;
    LookImportObserver& next_;
  };
  put(folder / "Warm.xml", "<look><LUT><size>1</size><a>0000803F</a><a>0000803F</a></LUT></look>");
  Remover remover(looks, witness);
  LookFileRef::initFromLookFile(folder / "Warm.xml", &remover);
  ASSERT_EQ(witness.tables.size(), 2u);
  EXPECT_TRUE(witness.tables[0].isNew);
  EXPECT_FALSE(witness.tables[1].isNew);
}

TEST_F(LookImport, LinkThatLeadsNowhereIsLeftAlone) {
  fs::create_symlink(folder / "nowhere", looks / "Warm.xml");
  import(onePoint);
  EXPECT_EQ(witness.tables.at(0).copy, Copy::alreadyThere);
  EXPECT_FALSE(witness.tables.at(0).copyError);
  EXPECT_FALSE(fs::exists(folder / "nowhere"));
}

TEST_F(LookImport, MillionTablesAlikeAreOneFile) {
  std::string description = "<look><LUT><size>64</size>";
  for (int i = 0; i < 1000000; ++i) description += "<a/>";
  put(folder / "Warm.xml", description + "</LUT></look>");
  EXPECT_EQ(LookFileRef::initFromLookFile(folder / "Warm.xml")->CRC(), 0u);
  EXPECT_EQ(files().size(), 2u);
}

TEST_F(LookImport, SizeHoldsUntilTheNextWithinItsLut) {
  import("<look><LUT><size>2</size><a>1</a><size>1</size><a>2</a><a>3</a></LUT></look>");
  ASSERT_EQ(witness.tables.size(), 3u);
  EXPECT_EQ(witness.tables[0].size, 2);
  EXPECT_EQ(witness.tables[1].size, 1);
  EXPECT_EQ(witness.tables[2].size, 1);
}

TEST_F(LookImport, SizeEndsWithItsLut) {
  EXPECT_FALSE(import("<look><LUT><size>1</size></LUT><LUT><a>0000803F</a></LUT></look>"));
  EXPECT_EQ(host->alerts.at(0), "Error : LUT (Warm.xml) has no defined table size");
}

TEST_F(LookImport, SizeOf64IsTakenAnd65IsNot) {
  EXPECT_TRUE(import("<look><LUT><size>64</size></LUT></look>"));
  EXPECT_FALSE(import("<look><LUT><size>65</size></LUT></look>"));
  EXPECT_EQ(host->alerts,
            (std::vector<std::string>{
                "Error : LUT (Warm.xml) is too large, a maximum of 64x64x64 is supported"}));
  ASSERT_EQ(witness.stops.size(), 1u);
  EXPECT_EQ(witness.stops[0].reason, LookImportStop::tooLarge);
  EXPECT_EQ(witness.stops[0].size, 65);
  EXPECT_EQ(witness.stops[0].offset, 11u);
  EXPECT_TRUE(files().empty());
}

TEST_F(LookImport, SizeTooLargeStaysSoWithoutATable) {
  EXPECT_FALSE(import("<look><LUT><size>99999999999</size><size>1</size></LUT></look>"));
}

TEST_F(LookImport, TableOf64PointsIsAFileOf3145792Bytes) {
  import("<look><LUT><size>64</size><a>0000803F</a></LUT></look>");
  EXPECT_EQ(files().at(lookFileNameOf(witness.tables.at(0).crc)).size(), 3145792u);
}

TEST_F(LookImport, TableWithoutASizeIsRefused) {
  for (const char* description : {
           "<look><LUT><a>0000803F</a></LUT></look>",
           "<look><LUT> <size>1</size><a>0000803F</a></LUT></look>",
           "<look><LUT><!----><size>1</size></LUT></look>",
           "<look><LUT><size>0</size><a>0000803F</a></LUT></look>",
           "<look><LUT><size> -1</size><a>0000803F</a></LUT></look>",
           "<look><LUT><size>x</size><a/></LUT></look>",
       }) {
    host->alerts.clear();
    EXPECT_FALSE(import(description));
    EXPECT_EQ(host->alerts.at(0), "Error : LUT (Warm.xml) has no defined table size");
    EXPECT_EQ(witness.stops.at(0).reason, LookImportStop::noSize);
    EXPECT_TRUE(files().empty());
  }
}

TEST_F(LookImport, SizeBelowOneWithoutATableIsTaken) {
  expectEmpty(import("<look><LUT><size>0</size></LUT><LUT><size> -5</size></LUT></look>"));
}

TEST_F(LookImport, FilesWrittenBeforeAnAlertStay) {
  EXPECT_FALSE(
      import("<look><LUT><size>1</size><a>0000803F0000003F0000803E</a><size>65</size>"
             "<b>0000803F</b></LUT></look>"));
  EXPECT_EQ(files().size(), 2u);
  EXPECT_TRUE(files().contains("B5CB6ADA.oxlook"));
  EXPECT_EQ(witness.tables.size(), 1u);
}

TEST_F(LookImport, WritesNothingOfAFileThatIsNotWellFormed) {
  const std::string whole = onePoint + "<";
  expectEmpty(import(whole));
  EXPECT_TRUE(files().empty());
  ASSERT_EQ(witness.stops.size(), 1u);
  EXPECT_EQ(witness.stops[0].reason, LookImportStop::notWellFormed);
  EXPECT_EQ(witness.stops[0].offset, onePoint.size());
  EXPECT_FALSE(witness.what.empty());
  EXPECT_TRUE(witness.tables.empty());
}

TEST_F(LookImport, EveryShorterFileGivesTheEmptyReference) {
  for (std::size_t size = 0; size < onePoint.size(); ++size) {
    expectEmpty(import(onePoint.substr(0, size)));
    EXPECT_TRUE(files().empty());
  }
}

std::string hundredTimes(std::string_view text) {
  std::string all;
  for (int i = 0; i < 100; ++i) all += text;
  return all;
}

TEST_F(LookImport, HostileFilesGiveTheEmptyReference) {
  const std::string body = "<LUT><size>1</size><a>0000803F</a>";
  std::string bomb = "<!DOCTYPE look [<!ENTITY e0 '" + std::string(100, 'F') + "'>";
  for (int i = 1; i <= 12; ++i) {
    bomb += "<!ENTITY e" + std::to_string(i) + " '";
    for (int k = 0; k < 10; ++k) bomb += "&e" + std::to_string(i - 1) + ";";
    bomb += "'>";
  }
  std::string declaring = "<!DOCTYPE look [<!ATTLIST LUT";
  for (int i = 0; i < 20000; ++i) declaring += " a" + std::to_string(i) + " CDATA 'x'";
  std::string deep;
  for (int i = 0; i < 100000; ++i) deep += "<a>";
  for (int i = 0; i < 100000; ++i) deep += "</a>";
  for (const std::string& file : {
           bomb + "]><look>" + body + "<a>&e12;</a></LUT></look>",
           declaring + ">]><look>" + body + "</LUT></look>",
           "<!DOCTYPE look [<!ENTITY e '" + std::string(1000000, 'x') + "'>]><look>" + body +
               "<a b='" + hundredTimes("&e;") + "'/></LUT></look>",
           "<look>" + body + deep + "</LUT></look>",
           "<look>" + body + std::string(1, '\0') + "</LUT></look>",
           "<look>" + body + "</LUT></look>" + std::string(100, '\0'),
           "<?xml version='1.0' encoding='UTF-16'?><look>" + body + "</LUT></look>",
           "<?xml version='1.0' encoding='x-unknown'?><look>" + body + "</LUT></look>",
           "<look>" + body + "\xE9</LUT></look>",
           "<look>" + body + "</LUT><LUT a='" + std::string(1000000, 'A') + "</look>",
           std::string("\xFF\xFE<\0l\0", 6),
           std::string(1000000, '<'),
           std::string(1000000, '>'),
           std::string(1000000, '\0'),
           std::string(1000000, 'A'),
       }) {
    expectEmpty(import(file));
    EXPECT_TRUE(files().empty());
    EXPECT_EQ(witness.stops.at(0).reason, LookImportStop::notWellFormed);
  }
}

TEST_F(LookImport, LoadsNothingFromOutside) {
  put(folder / "outside", "0000003F");
  const auto look = import(
      "<!DOCTYPE look [<!ENTITY e SYSTEM 'outside'>]>"
      "<look><LUT><size>1</size><a>0000803F&e;</a></LUT></look>");
  EXPECT_EQ(witness.tables.at(0).values.groups, 1u);
  EXPECT_EQ(look->CRC(), crcOf(std::string("\0\0\x80\x3F", 4)));
}

TEST_F(LookImport, FileThatCannotBeReadGivesTheEmptyReference) {
  for (const fs::path& path :
       {folder / "missing.xml", folder.path(), fs::path("/dev/null"), fs::path()}) {
    witness = {};
    expectEmpty(LookFileRef::initFromLookFile(path, &witness));
    ASSERT_EQ(witness.stops.size(), 1u);
    EXPECT_EQ(witness.stops[0].reason, LookImportStop::unreadable);
    EXPECT_TRUE(witness.stops[0].error);
  }
  EXPECT_TRUE(host->alerts.empty());
}

TEST_F(LookImport, DescriptionWithoutATableGivesTheEmptyReference) {
  expectEmpty(import("<look><other/></look>"));
  expectEmpty(import("<look><LUT/><LUT><size>3</size></LUT></look>"));
  EXPECT_TRUE(files().empty());
  EXPECT_TRUE(witness.stops.empty());
}

TEST_F(LookImport, FolderThatIsMissingIsReportedOnly) {
  host->strings["OXMVLutsPath"] = folder / "missing";
  const auto look = import(onePoint);
  EXPECT_EQ(look->CRC(), 0xB5CB6ADAu);
  EXPECT_EQ(look->version(), 2);
  EXPECT_EQ(look->displayName(), "Warm");
  const LookTableReport& table = witness.tables.at(0);
  EXPECT_TRUE(table.isNew);
  EXPECT_EQ(table.writeError, std::errc::no_such_file_or_directory);
  EXPECT_EQ(table.copy, Copy::failed);
  EXPECT_EQ(table.copyError, std::errc::no_such_file_or_directory);
  EXPECT_FALSE(fs::exists(folder / "missing"));
}

TEST_F(LookImport, LongNamesAreCut) {
  const std::string name(44, 'x');
  EXPECT_EQ(import(onePoint, name + ".xml")->displayName(), name.substr(0, 39));
  EXPECT_EQ(files().at("B5CB6ADA.oxlook").substr(24, 40), std::string(40, '\0'));
  EXPECT_EQ(files().at(name + ".xml"), onePoint);
}

TEST_F(LookImport, NameInAnAlertIsTheFilesOwn) {
  EXPECT_FALSE(import("<look><LUT><a/></LUT></look>", "100% %@ W\u00E4rme.v2.xml"));
  EXPECT_EQ(host->alerts.at(0),
            "Error : LUT (100% %@ W\u00E4rme.v2.xml) has no defined table size");
}

TEST_F(LookImport, WritesNoMoreThanItsLimit) {
  put(folder / "Warm.xml",
      "<look><LUT><size>1</size><a>0000803F</a><a>0000003F</a><a>0000803E</a></LUT></look>");
  const auto look = importLook(folder / "Warm.xml", &witness, 2 * 76 + 75);
  ASSERT_EQ(witness.tables.size(), 2u);
  EXPECT_EQ(look->CRC(), witness.tables[1].crc);
  ASSERT_EQ(witness.stops.size(), 1u);
  EXPECT_EQ(witness.stops[0].reason, LookImportStop::tooMuch);
  EXPECT_EQ(files().size(), 3u);
  EXPECT_TRUE(host->alerts.empty());
  EXPECT_EQ(maxImportedBytes, 1073741824u);

  fs::remove_all(looks);
  fs::create_directory(looks);
  witness = {};
  importLook(folder / "Warm.xml", &witness, 3 * 76);
  EXPECT_EQ(witness.tables.size(), 3u);
  EXPECT_TRUE(witness.stops.empty());
}

TEST_F(LookImport, WritesNoMoreFilesThanItsLimit) {
  // The second is there already, and does not count.
  put(folder / "Warm.xml",
      "<look><LUT><size>1</size><a>0000803F</a><a>0000803F</a><a>0000003F</a></LUT></look>");
  EXPECT_TRUE(importLook(folder / "Warm.xml", &witness, maxImportedBytes, 2));
  EXPECT_TRUE(witness.stops.empty());
  EXPECT_EQ(files().size(), 3u);
  fs::remove_all(looks);
  fs::create_directory(looks);
  witness = {};
  const auto look = importLook(folder / "Warm.xml", &witness, maxImportedBytes, 1);
  ASSERT_EQ(witness.tables.size(), 1u);
  EXPECT_EQ(look->CRC(), witness.tables[0].crc);
  ASSERT_EQ(witness.stops.size(), 1u);
  EXPECT_EQ(witness.stops[0].reason, LookImportStop::tooMuch);
  EXPECT_EQ(files().size(), 2u);
  EXPECT_TRUE(host->alerts.empty());
  EXPECT_EQ(maxImportedFiles, 4096u);
}

TEST_F(LookImport, FilesThatCannotBeWrittenCount) {
  host->strings["OXMVLutsPath"] = folder / "missing";
  put(folder / "Warm.xml",
      "<look><LUT><size>1</size><a>0000803F</a><a>0000003F</a><a>0000803E</a></LUT></look>");
  importLook(folder / "Warm.xml", &witness, maxImportedBytes, 2);
  EXPECT_EQ(witness.tables.size(), 2u);
  EXPECT_EQ(witness.stops.at(0).reason, LookImportStop::tooMuch);
}

TEST_F(LookImport, AnswerIsTheSameWithoutAWitness) {
  put(folder / "Warm.xml", onePoint);
  EXPECT_EQ(LookFileRef::initFromLookFile(folder / "Warm.xml")->CRC(), 0xB5CB6ADAu);
}

TEST_F(LookImport, ValuesOfALargeTableArriveUnchanged) {
  // 64 points, in lines of twelve values and in one line, which is more than 6 MB of text.
  std::mt19937 random(6);
  std::string values;
  std::string text;
  std::string lines;
  for (std::size_t i = 0; i < lookValueCount(64); ++i) {
    for (int k = 0; k < 4; ++k) {
      const auto byte = static_cast<std::uint8_t>(random());
      values += static_cast<char>(byte);
      for (const char digit : {"0123456789ABCDEF"[byte >> 4], "0123456789abcdef"[byte & 0xF]}) {
        text += digit;
        lines += digit;
      }
    }
    if (i % 12 == 11) lines += '\n';
  }
  for (const std::string& data : {'"' + text + '"', lines}) {
    const auto look = import("<look><LUT><size>64</size><data>" + data + "</data></LUT></look>");
    EXPECT_EQ(look->CRC(), crcOf(values));
    const std::string file = files().at(lookFileNameOf(look->CRC()));
    EXPECT_TRUE(file.substr(64) == values);
    fs::remove(looks / lookFileNameOf(look->CRC()));
  }
}

// Each description of tests/data/looks gives exactly what index.json says, and exactly the files
// beside it.
TEST(LookSamples, ImportToTheirFiles) {
  const Bytes indexText = test::testData("looks/index.json");
  const auto index = nlohmann::json::parse(indexText.begin(), indexText.end());
  EXPECT_EQ(index.size(), 20u);
  const fs::path data = fs::path(OXMV_TEST_DATA) / "looks";
  for (const auto& [name, expected] : index.items()) {
    SCOPED_TRACE(name);
    const TempDir folder;
    test::InstalledFakeHost host;
    host->strings["OXMVLutsPath"] = folder.path();
    const fs::path path = fs::exists(data / name) ? data / name : data / "illegal" / name;
    const auto look = LookFileRef::initFromLookFile(path);

    EXPECT_EQ(look.has_value(), expected["result"] == "ref");
    const LookFileRef reference = look.value_or(LookFileRef());
    EXPECT_EQ(lookFileNameOf(reference.CRC()), expected["crc"].get<std::string>() + ".oxlook");
    EXPECT_EQ(reference.version(), expected["version"]);
    EXPECT_EQ(reference.displayName().has_value(), !expected["name"].is_null());
    if (reference.displayName()) {
      EXPECT_EQ(*reference.displayName(), expected["name"]);
    }
    if (expected["alert"].is_null()) {
      EXPECT_TRUE(host->alerts.empty());
    } else {
      EXPECT_EQ(host->alerts, std::vector<std::string>{expected["alert"]});
    }

    EXPECT_EQ(fs::exists(folder / name), expected["copied"].get<bool>());
    if (expected["copied"]) {
      EXPECT_TRUE(get(folder / name) == get(path));
    }
    fs::remove(folder / name);
    for (const auto& [file, facts] : expected["files"].items()) {
      EXPECT_EQ(fs::file_size(folder / file), facts["bytes"]);
      EXPECT_TRUE(get(folder / file) == get(data / "expected" / name / file)) << file;
      fs::remove(folder / file);
    }
    EXPECT_TRUE(fs::is_empty(folder.path()));
  }
}

TEST(LookSamples, SecondImportDoesNothing) {
  for (const std::string& name : test::testDataNames("looks", ".xml")) {
    SCOPED_TRACE(name);
    const TempDir folder;
    test::InstalledFakeHost host;
    host->strings["OXMVLutsPath"] = folder.path();
    const fs::path path = fs::path(OXMV_TEST_DATA) / "looks" / (name + ".xml");
    ASSERT_TRUE(LookFileRef::initFromLookFile(path));
    const auto look = LookFileRef::initFromLookFile(path);
    ASSERT_TRUE(look);
    EXPECT_EQ(look->CRC(), 0u);
    EXPECT_EQ(look->version(), 0);
    EXPECT_EQ(look->displayName(), std::nullopt);
  }
}

TEST_F(LookImport, IsTheSameForAnObserverThatDoesNotListen) {
  class Deaf final : public LookImportObserver {};
  Deaf deaf;
  put(folder / "Warm.xml", onePoint);
  const auto look = LookFileRef::initFromLookFile(folder / "Warm.xml", &deaf);
  ASSERT_TRUE(look);
  EXPECT_EQ(look->displayName(), "Warm");
  put(folder / "None.xml", "<look><LUT><a/></LUT></look>");
  EXPECT_FALSE(LookFileRef::initFromLookFile(folder / "None.xml", &deaf));
}

}  // namespace
}  // namespace oxmv
