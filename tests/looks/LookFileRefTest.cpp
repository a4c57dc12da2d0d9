#include <algorithm>
#include <fstream>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "oxmv/looks/LookFileRef.h"
#include "oxmv/looks/LookTableFile.h"
#include "support/FakeHost.h"
#include "support/TempDir.h"

namespace oxmv {
namespace {

namespace fs = std::filesystem;
using test::TempDir;
using Bytes = std::vector<std::uint8_t>;

void put(const fs::path& path, const Bytes& content) {
  std::ofstream(path, std::ios::binary)
      .write(reinterpret_cast<const char*>(content.data()),
             static_cast<std::streamsize>(content.size()));
}

Bytes get(const fs::path& path) {
  std::ifstream file(path, std::ios::binary);
  return {std::istreambuf_iterator<char>(file), {}};
}

// The file of a look of one point.
Bytes lookFile(std::string_view magic, const Bytes& version, std::string_view name) {
  Bytes bytes(76);
  std::copy(magic.begin(), magic.end(), bytes.begin());
  std::copy(version.begin(), version.end(), bytes.begin() + 4);
  std::copy(name.begin(), name.end(), bytes.begin() + 24);
  return bytes;
}

const Bytes version1 = {1, 0, 0, 0};
const Bytes version2 = {2, 0, 0, 0};

// A reference to a file of that name and content.
std::optional<LookFileRef> fromFile(const std::string& name, const Bytes& content) {
  const TempDir folder;
  put(folder / name, content);
  return LookFileRef::initFromPath(folder / name);
}

// A reference of that name to show.
LookFileRef named(const std::string& name) {
  return fromFile("1", lookFile("OXLK", version2, name)).value();
}

LookFileRef nameless() { return fromFile("1", lookFile("OXLK", version2, "\xE4")).value(); }

TEST(LookFileRef, FreshIsEmpty) {
  const LookFileRef look;
  EXPECT_EQ(look.CRC(), 0u);
  EXPECT_EQ(look.version(), 0);
  EXPECT_EQ(look.displayName(), std::nullopt);
}

TEST(LookFileRef, NoneIsNamedNone) {
  const LookFileRef look = LookFileRef::initNone();
  EXPECT_EQ(look.CRC(), 0u);
  EXPECT_EQ(look.version(), 0);
  EXPECT_EQ(look.displayName(), "None");
}

TEST(LookFileRef, LengthIsAlwaysZero) {
  EXPECT_EQ(LookFileRef().length(), 0);
  EXPECT_EQ(LookFileRef::initNone().length(), 0);
  EXPECT_EQ(named("Warm").length(), 0);
}

TEST(InitFromPath, ReadsCrcVersionAndName) {
  const auto look = fromFile("1A2B3C4D.oxlook", lookFile("OXLK", version2, "Warm"));
  ASSERT_TRUE(look);
  EXPECT_EQ(look->CRC(), 0x1A2B3C4Du);
  EXPECT_EQ(look->version(), 2);
  EXPECT_EQ(look->displayName(), "Warm");
}

TEST(InitFromPath, KeepsTheExtensionOfVersionOne) {
  const auto look = fromFile("1A2B3C4D.oxlook", lookFile("OXLK", version1, "Warm"));
  ASSERT_TRUE(look);
  EXPECT_EQ(look->CRC(), 0x1A2B3C4Du);
  EXPECT_EQ(look->version(), 1);
  EXPECT_EQ(look->displayName(), "1A2B3C4D.oxlook");
}

TEST(InitFromPath, OfVersionAboveTwoReadsTheName) {
  EXPECT_EQ(fromFile("1.oxlook", lookFile("OXLK", {3, 0, 0, 0}, "Warm"))->displayName(), "Warm");
}

TEST(InitFromPath, OfVersionBelowZeroShowsTheFileName) {
  const auto look = fromFile("1.oxlook", lookFile("OXLK", {0, 0, 0, 0x80}, "Warm"));
  EXPECT_LT(look->version(), 0);
  EXPECT_EQ(look->displayName(), "1.oxlook");
}

TEST(InitFromPath, ReadsTheOtherByteOrder) {
  const auto look = fromFile("1.oxlook", lookFile("KLXO", {0, 0, 0, 2}, "Warm"));
  EXPECT_EQ(look->version(), 2);
  EXPECT_EQ(look->displayName(), "Warm");
}

TEST(InitFromPath, OfAnotherMagicShowsTheFileName) {
  const auto look = fromFile("1A2B3C4D.oxlook", lookFile("LOOK", version2, "Warm"));
  EXPECT_EQ(look->CRC(), 0x1A2B3C4Du);
  EXPECT_EQ(look->version(), 0);
  EXPECT_EQ(look->displayName(), "1A2B3C4D.oxlook");
}

TEST(InitFromPath, TakesTheCrcFromTheFileName) {
  const Bytes file = lookFile("OXLK", version2, "Warm");
  EXPECT_EQ(fromFile("0x00ff.oxlook", file)->CRC(), 0xFFu);
  EXPECT_EQ(fromFile("beef-copy.oxlook", file)->CRC(), 0xBEEFu);
  EXPECT_EQ(fromFile(" 12", file)->CRC(), 0x12u);
  EXPECT_EQ(fromFile("123456789.oxlook", file)->CRC(), 0xFFFFFFFFu);
  EXPECT_FALSE(fromFile("look.oxlook", file));
  EXPECT_FALSE(fromFile(".oxlook", file));
}

TEST(InitFromPath, NameLosesFoldersAndExtension) {
  EXPECT_EQ(named("looks/Warm.2.xml").displayName(), "Warm.2");
  EXPECT_EQ(named("").displayName(), "");
}

TEST(InitFromPath, NameThatIsNotAsciiIsNone) {
  const auto look = fromFile("1.oxlook", lookFile("OXLK", version2, "W\xE4rme"));
  EXPECT_EQ(look->version(), 2);
  EXPECT_EQ(look->displayName(), std::nullopt);
}

TEST(InitFromPath, EveryShorterFileIsOfAnotherKindOrHasAnEmptyName) {
  const Bytes whole = lookFile("OXLK", version2, "Warm");
  for (std::size_t size = 0; size < whole.size(); ++size) {
    const auto look =
        fromFile("12.oxlook", Bytes(whole.begin(), whole.begin() + static_cast<int>(size)));
    ASSERT_TRUE(look);
    EXPECT_EQ(look->CRC(), 0x12u);
    EXPECT_EQ(look->version(), size < 8 ? 0 : 2) << size;
    EXPECT_EQ(look->displayName(), size < 8 ? "12.oxlook" : size < 29 ? "" : "Warm") << size;
  }
}

TEST(InitFromPath, FileThatCannotBeOpenedIsNothing) {
  const TempDir folder;
  EXPECT_FALSE(LookFileRef::initFromPath(folder / "12.oxlook"));
  fs::create_directory(folder / "12.oxlook");
  EXPECT_FALSE(LookFileRef::initFromPath(folder / "12.oxlook"));
  EXPECT_FALSE(LookFileRef::initFromPath("/dev/null"));
  EXPECT_FALSE(LookFileRef::initFromPath(""));
  EXPECT_FALSE(LookFileRef::initFromPath(std::string("12\0", 3)));
}

TEST(InitFromPath, FileThatCannotBeReadIsEmpty) {
  // Opens like a regular file, and has nothing at its start. The name would be no number.
  const auto look = LookFileRef::initFromPath("/proc/self/mem");
  ASSERT_TRUE(look);
  EXPECT_EQ(look->CRC(), 0u);
  EXPECT_EQ(look->version(), 0);
  EXPECT_EQ(look->displayName(), std::nullopt);
}

TEST(InitFromRef, TakesEverythingOver) {
  const auto look = fromFile("1A2B3C4D.oxlook", lookFile("OXLK", version2, "Warm"));
  const LookFileRef copy = LookFileRef::initFromRef(*look);
  EXPECT_EQ(copy.CRC(), 0x1A2B3C4Du);
  EXPECT_EQ(copy.version(), 2);
  EXPECT_EQ(copy.displayName(), "Warm");
  EXPECT_EQ(LookFileRef::initFromRef(LookFileRef()).displayName(), std::nullopt);
}

TEST(InitFromRef, KeepsTheSuffixInTheName) {
  LookFileRef look = named("Warm");
  look.makeNameUnique(3);
  LookFileRef copy = LookFileRef::initFromRef(look);
  EXPECT_EQ(copy.displayName(), "Warm_3");
  copy.makeNameUnique(0);
  EXPECT_EQ(copy.displayName(), "Warm_3");
  copy.makeNameUnique(1);
  EXPECT_EQ(copy.displayName(), "Warm_3_1");
}

TEST(DisplayName, HasTheModifierUnlessThatIsZero) {
  LookFileRef look = named("Skin");
  EXPECT_EQ(look.displayName(), "Skin");
  look.makeNameUnique(2);
  EXPECT_EQ(look.displayName(), "Skin_2");
  look.makeNameUnique(-1);
  EXPECT_EQ(look.displayName(), "Skin_-1");
  look.makeNameUnique(-2147483647 - 1);
  EXPECT_EQ(look.displayName(), "Skin_-2147483648");
  look.makeNameUnique(0);
  EXPECT_EQ(look.displayName(), "Skin");
}

TEST(DisplayName, WithoutABaseNameIsNone) {
  LookFileRef look;
  look.makeNameUnique(2);
  EXPECT_EQ(look.displayName(), std::nullopt);
}

TEST(LookNameCompare, IsWithoutCase) {
  EXPECT_EQ(named("warm").lookNameCompare(named("WARM")), std::weak_ordering::equivalent);
  EXPECT_EQ(named("Cold").lookNameCompare(named("warm")), std::weak_ordering::less);
  EXPECT_EQ(named("warm").lookNameCompare(named("Cold")), std::weak_ordering::greater);
}

TEST(LookNameCompare, LooksAtTheModifier) {
  LookFileRef look = named("Warm");
  look.makeNameUnique(1);
  EXPECT_EQ(look.lookNameCompare(named("WARM_1")), std::weak_ordering::equivalent);
  EXPECT_EQ(look.lookNameCompare(named("Warm")), std::weak_ordering::greater);
}

TEST(LookNameCompare, WithoutANameIsEqualToAll) {
  EXPECT_EQ(nameless().lookNameCompare(named("warm")), std::weak_ordering::equivalent);
  EXPECT_EQ(nameless().lookNameCompare(nameless()), std::weak_ordering::equivalent);
}

TEST(LookNameCompare, SortsAfterAnOtherWithoutAName) {
  EXPECT_EQ(named("warm").lookNameCompare(nameless()), std::weak_ordering::greater);
}

TEST(IsInArray, FindsNamesWithoutCase) {
  const std::vector<LookFileRef> looks = {named("Cold"), named("WARM")};
  EXPECT_TRUE(named("warm").isInArray(looks));
  EXPECT_FALSE(named("warm").isInArray({}));
  EXPECT_FALSE(named("hot").isInArray(looks));
}

TEST(IsInArray, WithoutANameIsInEveryArrayButTheEmpty) {
  const std::vector<LookFileRef> looks = {named("Cold")};
  EXPECT_TRUE(nameless().isInArray(looks));
  EXPECT_FALSE(nameless().isInArray({}));
  const std::vector<LookFileRef> without = {nameless()};
  EXPECT_FALSE(named("Cold").isInArray(without));
}

TEST(IsInArray, LeadsToUniqueNames) {
  std::vector<LookFileRef> looks;
  for (const char* name : {"Warm", "WARM", "warm", "Cold"}) {
    LookFileRef look = named(name);
    for (int n = 1; look.isInArray(looks); ++n) look.makeNameUnique(n);
    looks.push_back(look);
  }
  std::vector<std::string> names;
  for (const auto& look : looks) names.push_back(look.displayName().value());
  EXPECT_EQ(names, (std::vector<std::string>{"Warm", "WARM_1", "warm_2", "Cold"}));
}

class GenerateLUTFile : public testing::Test {
 protected:
  GenerateLUTFile() { host->strings["OXMVLutsPath"] = folder.path(); }

  bool generate(std::int32_t crc, std::int32_t size, std::string_view name,
                std::error_code* error = nullptr) {
    return look.generateLUTFile(crc, record, size, name, error);
  }

  TempDir folder;
  test::InstalledFakeHost host;
  LookFileRef look;
  Bytes record = Bytes(160, 0x11);
};

TEST_F(GenerateLUTFile, WritesHeaderAndTable) {
  std::error_code error = std::make_error_code(std::errc::io_error);
  EXPECT_TRUE(generate(0x00ABCDEF, 2, "Warm.xml", &error));
  EXPECT_FALSE(error);
  Bytes expected = {'O',  'X',  'L',  'K',  2,    0,    0,    0,    64,  0,   0,   0,
                    2,    0,    0,    0,  //
                    0x01, 0x5A, 0x01, 0x00, 0x0A, 0x16, 0x02, 0x00, 'W', 'a', 'r', 'm'};
  expected.resize(64);
  expected.resize(160, 0x11);
  EXPECT_EQ(get(folder / "00ABCDEF.oxlook"), expected);
  EXPECT_EQ(record, expected);
  EXPECT_EQ(look.CRC(), 0xABCDEFu);
  EXPECT_EQ(look.version(), 2);
  EXPECT_EQ(look.displayName(), "Warm");
}

TEST_F(GenerateLUTFile, TakesTheCrcAsBits) {
  EXPECT_TRUE(generate(-1, 1, "Warm"));
  EXPECT_EQ(look.CRC(), 0xFFFFFFFFu);
  EXPECT_TRUE(fs::exists(folder / "FFFFFFFF.oxlook"));
}

TEST_F(GenerateLUTFile, WritesNoMoreThanItsSizeAsksFor) {
  EXPECT_TRUE(generate(1, 1, "Warm"));
  EXPECT_EQ(fs::file_size(folder / "00000001.oxlook"), 76u);
}

TEST_F(GenerateLUTFile, KeepsThirtyNineCharactersAndStoresThirtyEight) {
  const std::string name(38, 'x');
  EXPECT_TRUE(generate(1, 1, name + ".xml"));
  EXPECT_EQ(look.displayName(), name);
  EXPECT_EQ(LookFileRef::initFromPath(folder / "00000001.oxlook")->displayName(), name);

  for (const std::size_t length : {39u, 40u, 44u}) {
    EXPECT_TRUE(generate(static_cast<int>(length), 1, std::string(length, 'x') + ".xml"));
    EXPECT_EQ(look.displayName(), name + "x");
    const Bytes file = get(folder / lookFileNameOf(static_cast<std::uint32_t>(length)));
    EXPECT_TRUE(std::all_of(file.begin() + 24, file.begin() + 64, [](auto b) { return b == 0; }));
  }
}

TEST_F(GenerateLUTFile, NameThatIsNotAsciiStaysInTheReferenceOnly) {
  EXPECT_TRUE(generate(1, 1, "\u00C9t\u00E9.xml"));
  EXPECT_EQ(look.displayName(), "\u00C9t\u00E9");
  EXPECT_EQ(LookFileRef::initFromPath(folder / "00000001.oxlook")->displayName(), "");
}

TEST_F(GenerateLUTFile, LeavesACurrentFileAlone) {
  for (const Bytes& current :
       {lookFile("OXLK", version2, "Old"), lookFile("KLXO", {0, 0, 0, 2}, "Old")}) {
    put(folder / "00000001.oxlook", current);
    const Bytes before = record;
    EXPECT_FALSE(generate(1, 2, "Warm"));
    EXPECT_EQ(get(folder / "00000001.oxlook"), current);
    EXPECT_EQ(record, before);
    EXPECT_EQ(look.CRC(), 0u);
    EXPECT_EQ(look.version(), 0);
    EXPECT_EQ(look.displayName(), std::nullopt);
  }
}

TEST_F(GenerateLUTFile, KeepsACurrentFileOfTheWrongLength) {
  const Bytes headerOnly = {'O', 'X', 'L', 'K', 2, 0, 0, 0};
  put(folder / "00000001.oxlook", headerOnly);
  EXPECT_FALSE(generate(1, 2, "Warm"));
  EXPECT_EQ(get(folder / "00000001.oxlook"), headerOnly);
}

TEST_F(GenerateLUTFile, ReplacesEveryOtherFile) {
  for (const Bytes& other :
       {lookFile("OXLK", version1, "Old"), lookFile("OXLK", {3, 0, 0, 0}, "Old"),
        lookFile("KLXO", version2, "Old"), lookFile("LOOK", version2, "Old"), Bytes{},
        Bytes{'O'}}) {
    put(folder / "00000001.oxlook", other);
    EXPECT_TRUE(generate(1, 2, "Warm"));
    EXPECT_EQ(get(folder / "00000001.oxlook"), record);
  }
}

TEST_F(GenerateLUTFile, RefusesSizesAndRecordsThatDoNotFit) {
  for (const std::int32_t size : {0, -1, -2147483647 - 1, 65, 2147483647, 3, 64}) {
    EXPECT_FALSE(generate(1, size, "Warm")) << size;
  }
  record.resize(159);
  EXPECT_FALSE(generate(1, 2, "Warm"));
  record.clear();
  EXPECT_FALSE(generate(1, 1, "Warm"));
  EXPECT_TRUE(fs::is_empty(folder.path()));
  EXPECT_EQ(look.CRC(), 0u);
}

TEST_F(GenerateLUTFile, AnswersTrueWhenTheFileCannotBeWritten) {
  host->strings["OXMVLutsPath"] = folder / "missing";
  std::error_code error;
  EXPECT_TRUE(generate(1, 2, "Warm", &error));
  EXPECT_EQ(error, std::errc::no_such_file_or_directory);
  EXPECT_EQ(look.CRC(), 1u);
  EXPECT_EQ(look.version(), 2);
  EXPECT_EQ(look.displayName(), "Warm");
  EXPECT_TRUE(generate(2, 2, "Cold"));  // and nobody needs to ask why
  EXPECT_TRUE(fs::is_empty(folder.path()));
}

TEST_F(GenerateLUTFile, AsksForTheFolderEachTime) {
  EXPECT_TRUE(generate(1, 2, "Warm"));
  fs::create_directory(folder / "other");
  host->strings["OXMVLutsPath"] = folder / "other";
  EXPECT_TRUE(generate(1, 2, "Warm"));
  EXPECT_TRUE(fs::exists(folder / "other/00000001.oxlook"));
}

TEST(LookTableFolder, IsAPathWhereTheHostHasNone) {
  const test::InstalledFakeHost host;
  EXPECT_EQ(lookTableFolder(), "a path");
  host->strings["OXMVLutsPath"] = "/looks";
  EXPECT_EQ(lookTableFolder(), "/looks");
}

}  // namespace
}  // namespace oxmv
