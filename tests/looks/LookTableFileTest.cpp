#include <algorithm>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "oxmv/looks/LookTableFile.h"

namespace oxmv {
namespace {

using Bytes = std::vector<std::uint8_t>;

// The start of a look-table file.
Bytes start(std::string_view magic, const Bytes& version, std::string_view name = "Warm") {
  Bytes bytes(64);
  std::copy(magic.begin(), magic.end(), bytes.begin());
  std::copy(version.begin(), version.end(), bytes.begin() + 4);
  std::copy(name.begin(), name.end(), bytes.begin() + 24);
  return bytes;
}

TEST(LookHeader, IsStoredByteForByte) {
  OXLOOK_HEADER header;
  header.lutSize = 2;
  header.lutName = lookNameField("Warm");
  Bytes bytes(64, 0xEE);
  storeLookHeader(header, bytes);
  Bytes expected = {
      'O',  'X',  'L',  'K',   // magic
      2,    0,    0,    0,     // version
      64,   0,    0,    0,     // headerSize
      2,    0,    0,    0,     // lutSize
      0x01, 0x5A, 0x01, 0x00,  // constantA
      0x0A, 0x16, 0x02, 0x00,  // constantB
      'W',  'a',  'r',  'm',
  };
  expected.resize(64);
  EXPECT_EQ(bytes, expected);
}

TEST(LookHeader, IsLoadedInEitherByteOrder) {
  OXLOOK_HEADER header;
  header.lutSize = 17;
  header.lutName = lookNameField("Warm");
  Bytes bytes(64);
  storeLookHeader(header, bytes);
  for (const bool isSwapped : {false, true}) {
    if (isSwapped) {
      for (std::size_t i = 0; i < 24; i += 4)
        std::reverse(bytes.begin() + static_cast<std::ptrdiff_t>(i),
                     bytes.begin() + static_cast<std::ptrdiff_t>(i + 4));
    }
    const auto loaded = loadLookHeader(bytes);
    ASSERT_TRUE(loaded);
    EXPECT_EQ(std::string(loaded->magic.data(), 4), isSwapped ? "KLXO" : "OXLK");
    EXPECT_EQ(loaded->version, 2u);
    EXPECT_EQ(loaded->headerSize, 64u);
    EXPECT_EQ(loaded->lutSize, 17u);
    EXPECT_EQ(loaded->constantA, 0x00015A01u);
    EXPECT_EQ(loaded->constantB, 0x0002160Au);
    EXPECT_EQ(loaded->lutName, header.lutName);
  }
}

TEST(LookHeader, NumbersOfTheOtherByteOrderHaveAllTheirBytes) {
  Bytes bytes(lookHeaderSize);
  storeLookHeader({}, bytes);
  std::reverse(bytes.begin(), bytes.begin() + 4);
  for (std::uint8_t i = 4; i < 24; ++i) bytes[i] = static_cast<std::uint8_t>(0xA0 + i);
  const auto header = loadLookHeader(bytes);
  ASSERT_TRUE(header);
  EXPECT_EQ(header->version, 0xA4A5A6A7u);
  EXPECT_EQ(header->headerSize, 0xA8A9AAABu);
  EXPECT_EQ(header->lutSize, 0xACADAEAFu);
  EXPECT_EQ(header->constantA, 0xB0B1B2B3u);
  EXPECT_EQ(header->constantB, 0xB4B5B6B7u);
}

TEST(LookHeader, OfAnotherMagicOrTooFewBytesIsNothing) {
  EXPECT_FALSE(loadLookHeader(start("OXLX", {2, 0, 0, 0})));
  const Bytes bytes = start("OXLK", {2, 0, 0, 0});
  EXPECT_TRUE(loadLookHeader(bytes));
  for (std::size_t size = 0; size < bytes.size(); ++size)
    EXPECT_FALSE(loadLookHeader(std::span(bytes).first(size))) << size;
}

TEST(LookFileSize, IsSixtyFourBytesAndTwelveForAPoint) {
  EXPECT_EQ(lookFileSize(1), 76u);
  EXPECT_EQ(lookFileSize(2), 160u);
  EXPECT_EQ(lookFileSize(64), 3145792u);
}

std::string field(std::string_view name) {
  const auto bytes = lookNameField(name);
  EXPECT_EQ(bytes[38], 0);
  EXPECT_EQ(bytes[39], 0);
  return std::string(bytes.data(), std::string_view(bytes.data(), 40).find('\0'));
}

TEST(LookNameField, HoldsThirtyEightCharacters) {
  const std::string name(38, 'x');
  EXPECT_EQ(field(name), name);
  EXPECT_EQ(field(""), "");
}

TEST(LookNameField, KeepsNothingOfThirtyNineCharacters) {
  EXPECT_EQ(field(std::string(39, 'x')), "");
}

TEST(LookNameField, KeepsNothingOfANameThatIsNotAscii) { EXPECT_EQ(field("Caf\u00E9"), ""); }

TEST(LookFileVersion, IsTheNumberAfterTheMagic) {
  EXPECT_EQ(lookFileVersion(start("OXLK", {2, 0, 0, 0})), 2);
  EXPECT_EQ(lookFileVersion(start("OXLK", {1, 0, 0, 0})), 1);
  EXPECT_EQ(lookFileVersion(start("OXLK", {4, 3, 2, 1})), 0x01020304);
  EXPECT_EQ(lookFileVersion(start("OXLK", {0xFF, 0xFF, 0xFF, 0xFF})), -1);
}

TEST(LookFileVersion, OfTheOtherByteOrderIsSwapped) {
  EXPECT_EQ(lookFileVersion(start("KLXO", {0, 0, 0, 2})), 2);
  EXPECT_EQ(lookFileVersion(start("KLXO", {0, 0, 0, 0xFF})), 255);
  EXPECT_EQ(lookFileVersion(start("KLXO", {0, 0, 1, 2})), 0x102);
}

TEST(LookFileVersion, KeepsTheSwapThatDropsTheSecondByteAndDoublesTheFirst) {
  EXPECT_EQ(lookFileVersion(start("KLXO", {0, 0x77, 0, 2})), 2);
  EXPECT_EQ(lookFileVersion(start("KLXO", {0x11, 0, 0, 2})), 0x11001102);
  EXPECT_EQ(lookFileVersion(start("KLXO", {0x11, 0x77, 0x22, 2})), 0x11003302);
  EXPECT_EQ(lookFileVersion(start("KLXO", {0x80, 0, 0, 0})), static_cast<std::int32_t>(0x80008000));
}

TEST(LookFileVersion, OfAnotherMagicOrTooFewBytesIsZero) {
  EXPECT_EQ(lookFileVersion(start("oxlk", {2, 0, 0, 0})), 0);
  EXPECT_EQ(lookFileVersion(start("OXLO", {2, 0, 0, 0})), 0);
  const Bytes whole = start("OXLK", {2, 0, 0, 0});
  for (std::size_t size = 0; size < 8; ++size) {
    EXPECT_EQ(lookFileVersion(std::span(whole).first(size)), 0) << size;
  }
  EXPECT_EQ(lookFileVersion(std::span(whole).first(8)), 2);
}

TEST(LookFileName, EndsAtItsZero) {
  EXPECT_EQ(lookFileName(start("OXLK", {2, 0, 0, 0}, "Warm")), "Warm");
  EXPECT_EQ(lookFileName(start("OXLK", {2, 0, 0, 0}, std::string("Wa\0rm", 5))), "Wa");
  EXPECT_EQ(lookFileName(start("OXLK", {2, 0, 0, 0}, "")), "");
}

TEST(LookFileName, WithoutAZeroEndsWithTheField) {
  EXPECT_EQ(lookFileName(start("OXLK", {2, 0, 0, 0}, std::string(40, 'x'))), std::string(40, 'x'));
}

TEST(LookFileName, NotAsciiIsNothing) {
  EXPECT_EQ(lookFileName(start("OXLK", {2, 0, 0, 0}, "W\xE4rme")), std::nullopt);
}

TEST(LookFileName, CutOffByTheEndOfTheFileIsEmpty) {
  const Bytes whole = start("OXLK", {2, 0, 0, 0}, "Warm");
  for (std::size_t size = 8; size <= 28; ++size) {
    EXPECT_EQ(lookFileName(std::span(whole).first(size)), "") << size;
  }
  EXPECT_EQ(lookFileName(std::span(whole).first(29)), "Warm");
}

TEST(IsCurrentLookFile, VersionTwoInEitherByteOrder) {
  EXPECT_TRUE(isCurrentLookFile(start("OXLK", {2, 0, 0, 0})));
  EXPECT_TRUE(isCurrentLookFile(start("KLXO", {0, 0, 0, 2})));
  EXPECT_FALSE(isCurrentLookFile(start("OXLK", {1, 0, 0, 0})));
  EXPECT_FALSE(isCurrentLookFile(start("OXLK", {0, 0, 0, 2})));
  EXPECT_FALSE(isCurrentLookFile(start("KLXO", {2, 0, 0, 0})));
  EXPECT_FALSE(isCurrentLookFile(start("XXXX", {2, 0, 0, 0})));
  // The swap would make 2 of it, but the number itself is looked at.
  EXPECT_FALSE(isCurrentLookFile(start("KLXO", {0, 7, 0, 2})));
  const Bytes whole = start("OXLK", {2, 0, 0, 0});
  EXPECT_FALSE(isCurrentLookFile(std::span(whole).first(7)));
  EXPECT_TRUE(isCurrentLookFile(std::span(whole).first(8)));
  EXPECT_FALSE(isCurrentLookFile({}));
}

TEST(LookFileNameOf, HasEightUpperCaseDigits) {
  EXPECT_EQ(lookFileNameOf(0x00ABCDEF), "00ABCDEF.oxlook");
  EXPECT_EQ(lookFileNameOf(0), "00000000.oxlook");
  EXPECT_EQ(lookFileNameOf(0xFFFFFFFF), "FFFFFFFF.oxlook");
}

TEST(CrcFromFileName, IsTheNumberAtTheStart) {
  EXPECT_EQ(crcFromFileName("1A2B3C4D"), 0x1A2B3C4Du);
  EXPECT_EQ(crcFromFileName("0x00ff"), 0xFFu);
  EXPECT_EQ(crcFromFileName("0X1f"), 0x1Fu);
  EXPECT_EQ(crcFromFileName("beef-copy"), 0xBEEFu);
  EXPECT_EQ(crcFromFileName("abcdef"), 0xABCDEFu);
  EXPECT_EQ(crcFromFileName("ABCDEF09"), 0xABCDEF09u);
  EXPECT_EQ(crcFromFileName(" \t\n12"), 0x12u);
  EXPECT_EQ(crcFromFileName("0"), 0u);
  EXPECT_EQ(crcFromFileName("00000000FFFFFFFF"), 0xFFFFFFFFu);
  EXPECT_EQ(crcFromFileName("000000001"), 1u);
}

TEST(CrcFromFileName, MoreThanThirtyTwoBitsAreAllOnes) {
  EXPECT_EQ(crcFromFileName("100000000"), 0xFFFFFFFFu);
  EXPECT_EQ(crcFromFileName("123456789abcdef0123456789"), 0xFFFFFFFFu);
}

TEST(CrcFromFileName, WithoutADigitIsNothing) {
  for (const char* stem : {"", " ", "look", "-1", "xff", "0x", "0xg", ".1", "#1"}) {
    EXPECT_EQ(crcFromFileName(stem), std::nullopt) << stem;
  }
}

TEST(LastPathComponent, IsWhatFollowsTheLastSlash) {
  EXPECT_EQ(lastPathComponent("a/b/Warm.xml"), "Warm.xml");
  EXPECT_EQ(lastPathComponent("Warm.xml"), "Warm.xml");
  EXPECT_EQ(lastPathComponent("a/b/"), "b");
  EXPECT_EQ(lastPathComponent("/"), "");
  EXPECT_EQ(lastPathComponent(""), "");
}

TEST(WithoutExtension, LosesWhatFollowsTheLastPoint) {
  EXPECT_EQ(withoutExtension("Warm.xml"), "Warm");
  EXPECT_EQ(withoutExtension("a.b/Warm"), "a.b/Warm");
  EXPECT_EQ(withoutExtension("a.b/Warm.2.xml"), "a.b/Warm.2");
  EXPECT_EQ(withoutExtension("Warm..xml"), "Warm.");
  EXPECT_EQ(withoutExtension("Warm."), "Warm");
  EXPECT_EQ(withoutExtension(".xml"), ".xml");
  EXPECT_EQ(withoutExtension(""), "");
}

TEST(CutDisplayName, KeepsThirtyNineCharacters) {
  const std::string most(39, 'x');
  EXPECT_EQ(cutDisplayName(most), most);
  EXPECT_EQ(cutDisplayName(most + "y"), most);
  EXPECT_EQ(cutDisplayName(most + "yyyyy"), most);
  EXPECT_EQ(cutDisplayName(""), "");
}

TEST(CutDisplayName, CountsCharactersNotBytes) {
  std::string accents;
  for (int i = 0; i < 39; ++i) accents += "\u00E9";
  EXPECT_EQ(cutDisplayName(accents), accents);
  EXPECT_EQ(cutDisplayName(accents + "\u00E9"), accents);
}

TEST(CutDisplayName, SplitsNoCharacter) {
  const std::string almost(38, 'x');
  EXPECT_EQ(cutDisplayName(almost + "\U0001F3A8"), almost);  // two units: one too many
  EXPECT_EQ(cutDisplayName(almost.substr(1) + "\U0001F3A8"), almost.substr(1) + "\U0001F3A8");
}

TEST(CutDisplayName, TakesBytesThatAreNoText) {
  const std::string bytes(100, '\xFF');
  EXPECT_LT(cutDisplayName(bytes).size(), bytes.size());
  EXPECT_EQ(cutDisplayName(std::string(50, '\x80')).substr(0, 1), "\x80");
}

TEST(OXLookFileRecord, IsHeaderAndTable) {
  OXLookFileRecord record;
  record.reset(2);
  EXPECT_EQ(record.bytes().size(), 160u);
  EXPECT_EQ(record.table().size(), 96u);
  EXPECT_EQ(Bytes(record.table().begin(), record.table().end()), Bytes(96));
}

TEST(OXLookFileRecord, IsZeroAgainAfterReset) {
  OXLookFileRecord record;
  record.reset(2);
  EXPECT_EQ(record.readTable("FFFFFFFFFFFFFFFFFFFFFFFF").stored, 3u);
  EXPECT_EQ(record.table()[11], 0xFF);
  record.reset(1);
  EXPECT_EQ(Bytes(record.table().begin(), record.table().end()), Bytes(12));
  // Text that is not ASCII is read twice; nothing of the first reading may stay.
  EXPECT_EQ(record.readTable("FFFFFFFF FF\u00E9").stored, 2u);
  record.reset(3);
  EXPECT_EQ(Bytes(record.table().begin(), record.table().end()), Bytes(27 * 12));
}

TEST(OXLookFileRecord, ReadTwiceHasTheSecondTableOnly) {
  OXLookFileRecord record;
  record.reset(2);
  record.readTable("0000803F0000003F0000803E");
  EXPECT_EQ(record.readTable("12345678").stored, 1u);
  std::vector<std::uint8_t> expected = {0x12, 0x34, 0x56, 0x78};
  expected.resize(96);
  EXPECT_TRUE(std::equal(expected.begin(), expected.end(), record.table().begin()));
  EXPECT_EQ(record.readTable("").stored, 0u);
  expected.assign(96, 0);
  EXPECT_TRUE(std::equal(expected.begin(), expected.end(), record.table().begin()));
}

TEST(OXLookFileRecord, HeaderIsZeroAgainAfterReset) {
  OXLookFileRecord record;
  record.reset(1);
  storeLookHeader({}, record.bytes());
  record.reset(1);
  const auto bytes = record.bytes();
  EXPECT_TRUE(std::all_of(bytes.begin(), bytes.end(), [](auto byte) { return byte == 0; }));
}

TEST(OXLookFileRecord, HasRoomForItsValuesOnly) {
  OXLookFileRecord record;
  record.reset(1);
  const HexTable table = record.readTable(std::string(8 * 4, '1'));
  EXPECT_EQ(table.groups, 4u);
  EXPECT_EQ(table.stored, 3u);
}

}  // namespace
}  // namespace oxmv
