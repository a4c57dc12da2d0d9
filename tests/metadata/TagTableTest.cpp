#include <algorithm>
#include <array>
#include <cstddef>
#include <iterator>
#include <set>
#include <string>
#include <string_view>
#include <type_traits>

#include <gtest/gtest.h>

#include "oxmv/metadata/TagTable.h"
#include "tests/metadata/TagRules.h"
#include "tests/support/Printing.h"

namespace oxmv::test {
namespace {

using namespace std::string_view_literals;

// Tags in the source: four ASCII characters, and nothing else compiles.

template <std::size_t count>
struct Literal {
  char characters[count];
  consteval Literal(const char (&text)[count]) { std::copy_n(text, count, characters); }
};

template <Literal text>
concept IsTag = requires {
  typename std::integral_constant<Tag, operator""_tag(text.characters, sizeof text.characters - 1)>;
};

static_assert(IsTag<"REEL"> && IsTag<"TAG "> && IsTag<"CTLp">);
static_assert(!IsTag<"REE"> && !IsTag<"REELS"> && !IsTag<"">);
static_assert(!IsTag<"RE\xC9L"> && !IsTag<"\x80"
                                          "EEL">);

static_assert("TIMC"_tag == Tag{0x434D4954}, "the first character stands lowest");
static_assert(tagOf({'T', 'I', 'M', 'C'}) == "TIMC"_tag);
static_assert(tagOf({0xFF, 0, 0x80, 1}) == Tag{0x018000FF}, "any four bytes are a tag");
static_assert(charactersOf("TIMC"_tag) == std::array{'T', 'I', 'M', 'C'});

// Everything that the format knows, once.
std::set<std::string_view> allTags() {
  std::set<std::string_view> tags;
  const auto add = [&](const auto& rule) { tags.insert(std::begin(rule), std::end(rule)); };
  add(readAsText), add(readAsInt32), add(readAsUint8), add(readAsUint16), add(readAsFloat);
  add(readAs2Floats), add(readAs3Floats), add(readAs4Floats), add(readAs8Floats);
  add(readAs9Floats), add(readAs12Floats), add(readAsIntegers), add(readAsData), add(readAsGuid);
  add(readAsNested), add(readAsTexts), add(readAsInts), add(readAsNestedList);
  add(readAsControlPoint), add(readAsTagName), add(readAsTagValue), add(readAsRegName);
  add(readAsRegValue), add(neverRead);
  return tags;
}

Tag tagFrom(std::string_view text) {
  std::array<std::uint8_t, 4> bytes{};
  std::copy_n(text.begin(), 4, bytes.begin());
  return tagOf(bytes);
}

TEST(TagTable, HasARowForEveryTagAndNoOther) {
  std::set<std::string> rows;
  for (const TagRow& row : tagRows()) {
    const std::array<char, 4> characters = charactersOf(row.tag);
    rows.emplace(characters.begin(), characters.end());
  }
  const auto tags = allTags();
  EXPECT_EQ(rows, std::set<std::string>(tags.begin(), tags.end()));
  EXPECT_EQ(tagRows().size(), tags.size()) << "no tag twice";
  EXPECT_EQ(tagRows().size(), 210u);
}

TEST(TagTable, FindsEveryRowByTagAndByKey) {
  for (const std::string_view tag : allTags()) {
    const TagRow* row = findTagRow(tagFrom(tag));
    ASSERT_NE(row, nullptr) << tag;
    EXPECT_EQ(row->tag, tagFrom(tag));
    EXPECT_EQ(findTagRow(tag), row);
    EXPECT_GE(row, tagRows().data());
    EXPECT_LT(row, tagRows().data() + tagRows().size());
  }
}

TEST(TagTable, FindsNoOtherTag) {
  std::set<Tag> known;
  for (const std::string_view tag : allTags()) known.insert(tagFrom(tag));
  for (const std::string_view other :
       {"\0\0\0\0"sv, "\xFF\xFF\xFF\xFF"sv, "reel"sv, "CTLP"sv, "ctlp"sv, "DSPM"sv, "TAG\0"sv,
        "CTLPData"sv, "ZZZZ"sv, "AAAA"sv, "    "sv}) {
    EXPECT_EQ(findTagRow(tagFrom(other)), nullptr) << other;
  }
  std::uint32_t state = 1;
  for (int i = 0; i < 1'000'000; ++i) {
    state = state * 1664525u + 1013904223u;  // a linear congruential generator
    ASSERT_EQ(findTagRow(Tag{state}) != nullptr, known.contains(Tag{state})) << state;
  }
  // The nearest of all: one bit away from a tag.
  for (const Tag tag : known) {
    for (unsigned bit = 0; bit < 32; ++bit) {
      const Tag other{static_cast<std::uint32_t>(tag) ^ 1u << bit};
      ASSERT_EQ(findTagRow(other) != nullptr, known.contains(other));
    }
  }
}

TEST(TagTable, KeyOfAnotherLengthHasNoRow) {
  for (const std::string_view key :
       {""sv, "R"sv, "REE"sv, "REELS"sv, "REEL\0"sv, "REELREEL"sv, "TAG"sv, "CTLPData"sv}) {
    EXPECT_EQ(findTagRow(key), nullptr) << key;
  }
}

TEST(TagTable, RowsStandInTheOrderOfTheirCharacters) {
  std::array<char, 4> before{};
  for (const TagRow& row : tagRows()) {
    EXPECT_LT(before, charactersOf(row.tag));
    before = charactersOf(row.tag);
  }
}

// Every label, and no other row has one.
TEST(TagTable, LabelsFortySixTags) {
  constexpr std::pair<std::string_view, std::string_view> labels[] = {
      {"COLM", "Color Matrix"},      {"BMTX", "Unity Matrix"},
      {"SATU", "Saturation"},        {"BLSH", "BlurSharpen"},
      {"RGBG", "RGB Gain"},          {"RGBO", "RGB Black Offset"},
      {"TIMC", "Timecode"},          {"TIMA", "Timecode ALT"},
      {"TIMB", "Timecode Base"},     {"TIMD", "TC Dropframe"},
      {"REEL", "Reel name"},         {"REEA", "Reel name ALT"},
      {"LOGC", "Log comment"},       {"WBAL", "White balance"},
      {"LOOK", "LOOK file"},         {"LCRC", "LOOK CRC"},
      {"ECRV", "Encode Curve"},      {"DCRV", "Decode Curve"},
      {"CCRV", "Primaries Curve"},   {"TAKE", "Take number"},
      {"SHOT", "Shot number"},       {"SCEN", "Scene number"},
      {"PROJ", "Project number"},    {"CAMR", "Camera number"},
      {"DATE", "Encode Date"},       {"TIME", "Encode Time"},
      {"SDAT", "Source Date"},       {"STIM", "Source Time"},
      {"PRNT", "Fingerprint"},       {"PIXR", "Pixel ratio"},
      {"BFMT", "Bayer format"},      {"SUBT", "OXMV subtype"},
      {"GAMT", "Channel gamma"},     {"MKGD", "Mark good take"},
      {"UFRM", "Unique frame num"},  {"GAIN", "Camera gain"},
      {"SHUT", "Shutter speed"},     {"CLSY", "Color space YUV"},
      {"CLSR", "Color space RGB"},   {"PCRV", "Encode preset"},
      {"ANKE", "Aux Ink out"},       {"ANKF", "Aux Ink film type"},
      {"ANKG", "Aux Ink edge type"}, {"ANKN", "Aux Ink"},
      {"ASCM", "ASC_SOP"},           {"ASCS", "ASC_SAT"}};
  static_assert(std::size(labels) == 46);
  for (const auto& [tag, label] : labels) EXPECT_EQ(findTagRow(tag)->label, label) << tag;
  EXPECT_EQ(std::ranges::count_if(tagRows(), [](const TagRow& row) { return !row.label.empty(); }),
            46);
}

TEST(TagTable, KeepsTheLabelOfMarkGoodTakeUnderATagThatIsNotWritten) {
  EXPECT_EQ(findTagRow("MKGD")->label, "Mark good take");
  EXPECT_EQ(findTagRow("MKGD")->write, Write::none);
  EXPECT_EQ(findTagRow("MRKG")->label, "");
  EXPECT_EQ(findTagRow("MRKG")->write, Write::integerL);
}

// In a few words.

TEST(TagTable, SaysHowATagIsReadWrittenAndAccepted) {
  struct Words {
    std::string_view tag;
    std::string reads, writes, accepts;
  };
  const Words words[] = {
      {"WBAL", "4 floats", "f 16", "array of 4"},
      {"DASF", "2 floats", "f 8", "array of 2"},
      {"COLM", "12 floats", "f 48", "array of 12"},
      {"REEL", "text", "c text", "anything"},
      {"TIMC", "text", "c text, no NUL", "anything"},
      {"TAKE", "uint16", "B 4", "number"},
      {"TIMB", "uint8", "B 4", "number"},
      {"LCRC", "int32", "H 4", "number"},
      {"PRCS", "int32", "L 4", "number"},
      {"PIXR", "int32", "R 4", "number"},
      {"SATU", "float", "f 4", "number"},
      {"DTAG", "text", "F 4", "number"},
      {"FREE", "data", "c data", "nothing"},
      {"GUID", "GUID", "G 16", "nothing"},
      {"BADP", "int32 list", "H 4 x count", "-"},
      {"SCPg", "int32, repeated", "H 4 each", "-"},
      {"KWRd", "text, repeated", "c text each", "-"},
      {"COL1", "nested stream", "nested", "anything"},
      {"DSPm", "nested stream, repeated", "nested each", "anything"},
      {"CTLp", "control point, repeated", "control point each", "anything"},
      {"TAG ", "-", "TAGN and TAGV", "-"},
      {"REG ", "-", "REGN and REGV", "-"},
      {"TAGN", "name in \"TAG \"", "-", "-"},
      {"TAGV", "value in \"TAG \"", "-", "-"},
      {"REGN", "name in \"REG \"", "-", "-"},
      {"REGV", "value in \"REG \"", "-", "-"},
      {"GHTL", "-", "H 4", "-"},
      {"AFMT", "-", "-", "-"},
  };
  for (const auto& [tag, reads, writes, accepts] : words) {
    const TagRow* row = findTagRow(tag);
    ASSERT_NE(row, nullptr) << tag;
    EXPECT_EQ(readsAs(*row), reads) << tag;
    EXPECT_EQ(writesAs(*row), writes) << tag;
    EXPECT_EQ(acceptsAs(*row), accepts) << tag;
  }
}

TEST(TagTable, PlainRuleOfEveryRowStandsAtItsIndex) {
  for (std::size_t i = 0; i < tagRows().size(); ++i) {
    const TagRow& row = tagRows()[i];
    EXPECT_EQ(detail::likelyRow(row.tag), i);
    EXPECT_EQ(detail::plainRules[i].tag, row.tag);
    EXPECT_EQ(detail::plainRules[i].read, row.read);
  }
}

TEST(TagTable, PlainRuleOfNoTagTakesNoSize) {
  const detail::PlainRule& rule = detail::plainRules[detail::noRow];
  for (std::uint32_t size = 0; size <= 0xFFFFFF; size += 5)
    ASSERT_GT(size - rule.least, rule.range) << size;
}

}  // namespace
}  // namespace oxmv::test
