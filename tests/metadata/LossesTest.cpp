#include <cstdint>
#include <limits>
#include <string>
#include <utility>
#include <vector>

#include <gtest/gtest.h>

#include "oxmv/metadata/Losses.h"
#include "oxmv/metadata/TagTable.h"
#include "oxmv/values/Array.h"
#include "tests/support/Printing.h"

namespace oxmv {
namespace {

using namespace std::string_literals;
using namespace std::string_view_literals;
using Found = std::vector<std::string>;

// Each loss as "code path", with "!" behind it if the other layout avoids it.
Found losses(const Dictionary& tags, Layout layout = Layout::exact) {
  Found found;
  const Layout other = layout == Layout::exact ? Layout::readable : Layout::exact;
  for (const Loss& loss : findLosses(tags, layout)) {
    EXPECT_FALSE(loss.message.empty());
    if (loss.avoidedBy) {
      EXPECT_EQ(*loss.avoidedBy, other);
    }
    found.push_back(std::string(codeOf(loss.code)) + ' ' + loss.path + (loss.avoidedBy ? "!" : ""));
  }
  return found;
}

std::string messageOf(const Dictionary& tags) {
  const auto found = findLosses(tags, Layout::exact);
  return found.size() == 1 ? found[0].message : std::to_string(found.size()) + " losses";
}

Value bytes(std::size_t count) { return Value::data(std::vector<std::uint8_t>(count, 0x5A)); }

Value floats(std::size_t count) { return Array(std::vector<Value>(count, Value(0.5f))); }

std::string letters(std::size_t count) { return std::string(count, 'n'); }

TEST(Losses, FindsNoneWhereEverythingComesBack) {
  const Dictionary tags = {{"PRCS", -5},
                           {"TIMC", "01:00:00:00"},
                           {"REEL", "A001"},
                           {"NAME", letters(255)},
                           {"DTAG", "ABCD"},
                           {"SATU", 0.1f},
                           {"WBAL", floats(4)},
                           {"BADP", Array::of(7)},
                           {"SNID", Array()},
                           {"SCPg", Array::of(1, 2)},
                           {"KWRd", Array::of("four", "")},
                           {"GUID", bytes(16)},
                           {"FREE", bytes(65532)},
                           {"GAIN", 65535},
                           {"TAG ", Dictionary{{"ISO", 400}, {"Lens", "35mm"}, {"", ""}}},
                           {"COL1", Dictionary{{"SATU", 1.0f}}},
                           {"DSPm", Array::of(Dictionary(), Dictionary{{"TAKE", 1}})},
                           {"DTIN", 1},
                           {"DTDR", 2},
                           {"CTLp", Array::of(Dictionary{{"CTLPData", Array::of(1, -2)}})}};
  EXPECT_EQ(losses(tags, Layout::exact), Found());
  EXPECT_EQ(losses(tags, Layout::readable), Found());
  EXPECT_EQ(losses({}), Found());
}

TEST(Losses, NamesKeysThatAreNeverStored) {
  EXPECT_EQ(losses({{"ZZZZ", 1}}), Found{"unknown-tag ZZZZ"});
  EXPECT_EQ(losses({{"AFMT", 1}, {"CTFO", 1}}), (Found{"unknown-tag AFMT", "unknown-tag CTFO"}));
  EXPECT_EQ(losses({{"TAGN", "x"}}), Found{"unknown-tag TAGN"});
  EXPECT_EQ(losses({{"GHTL", 1}}), Found{"no-decoder GHTL"});
  EXPECT_EQ(losses({{"ABCDE", 1}, {"AB", 1}, {"", 1}}),
            (Found{"bad-key ABCDE", "bad-key AB", "bad-key "}));
  EXPECT_EQ(losses({{"R\xC3\xA9L", 1}}), Found{"bad-key R\xC3\xA9L"});
  EXPECT_EQ(losses({{"CTLPData", Array::of(1, 2)}}), Found{"bad-key CTLPData"});
}

TEST(Losses, PointsFromTheLabelledTagToTheStoredOne) {
  EXPECT_EQ(losses({{"MKGD", 1}}), Found{"unknown-tag MKGD"});
  EXPECT_NE(messageOf({{"MKGD", 1}}).find("MRKG"), std::string::npos);
}

TEST(Losses, NamesTextsThatAreNotStoredWhole) {
  for (const char* tag : {"TIMC", "REEL"}) {
    const std::string at = std::string(" ") + tag;
    EXPECT_EQ(losses({{tag, "Caf\xC3\xA9"}}), Found{"text-nonascii" + at});
    EXPECT_EQ(losses({{tag, letters(255)}}), Found());
    EXPECT_EQ(losses({{tag, letters(256)}}), Found{"text-long" + at});
    EXPECT_EQ(losses({{tag, letters(256) + "\xC3\xA9"}}), Found{"text-long" + at});
    EXPECT_EQ(losses({{tag, letters(254) + "\xC3\xA9"}}), Found{"text-nonascii" + at});
    EXPECT_EQ(losses({{tag, ""}}), Found{"text-empty" + at});
    EXPECT_EQ(losses({{tag, "a\0b"sv}}), Found{"text-nul" + at});
    EXPECT_EQ(losses({{tag, "ab\0"sv}}), Found{"text-nul" + at});
    EXPECT_EQ(losses({{tag, 5}}), Found{"wrong-kind" + at});
  }
  EXPECT_EQ(losses({{"DTAG", "ABCDE"}}), Found{"text-long DTAG"});
  EXPECT_EQ(losses({{"DTAG", "AB\xC3\xA9"}}), Found{"text-nonascii DTAG"});
  EXPECT_EQ(losses({{"DTAG", 7}}), Found{"wrong-kind DTAG"});
  EXPECT_EQ(losses({{"DTAG", ""}}), Found());
}

TEST(Losses, SaysWhatWouldBeWritten) {
  EXPECT_EQ(messageOf({{"REEL", "Caf\xC3\xA9"}}),
            "\"Caf\xC3\xA9\" would be written as zeros: only ASCII is stored");
  EXPECT_EQ(messageOf({{"GAIN", 70000}}), "70000 would come back as 4464");
  EXPECT_EQ(messageOf({{"WBAL", floats(3)}}), "needs 4 numbers and has 3");
  EXPECT_EQ(messageOf({{"NAME", letters(300)}}),
            '"' + letters(40) + "...\" has 300 characters, of which 255 would be stored");
}

TEST(Losses, QuotesNoCharacterInPart) {
  EXPECT_EQ(messageOf({{"REEL", letters(39) + "\xC3\xA9x"}}),
            '"' + letters(39) + "...\" would be written as zeros: only ASCII is stored");
  EXPECT_EQ(messageOf({{"REEL", letters(38) + "\xC3\xA9x"}}),
            '"' + letters(38) + "\xC3\xA9...\" would be written as zeros: only ASCII is stored");
  EXPECT_EQ(messageOf({{"REEL", letters(38) + "\xC3\xA9"}}),
            '"' + letters(38) + "\xC3\xA9\" would be written as zeros: only ASCII is stored");
}

TEST(Losses, SaysHowManyNulsATextGains) {
  const auto message = [](std::string_view text) {
    return messageOf({{"KWRd", Array::of(text, "four")}});
  };
  EXPECT_EQ(message("abc"), "\"abc\" would gain a NUL at its end");
  EXPECT_EQ(message("ab"), "\"ab\" would gain 2 NULs at its end");
}

TEST(Losses, SaysWhatAValueWouldComeBackAs) {
  EXPECT_EQ(messageOf({{"TAKE", 2.0f}}), "is a float, and would come back as an integer");
  EXPECT_EQ(messageOf({{"SATU", "0.5"}}), "is a text, and would come back as a float");
  EXPECT_EQ(messageOf({{"WBAL", 3}}), "is an integer, which is not stored there");
}

TEST(Losses, NamesNumbersThatComeBackDifferent) {
  EXPECT_EQ(losses({{"GAIN", 65536}}), Found{"int-range GAIN"});
  EXPECT_EQ(losses({{"GAIN", -1}}), Found{"int-range GAIN"});
  EXPECT_EQ(losses({{"PROJ", 256}}), Found{"int-range PROJ"});
  EXPECT_EQ(losses({{"PRCS", std::int64_t{1} << 31}}), Found{"int-range PRCS"});
  EXPECT_EQ(losses({{"PRCS", std::numeric_limits<std::int32_t>::min()}}), Found());
  EXPECT_EQ(losses({{"LCRC", 0xFFFFFFFFu}}), Found{"int-range LCRC"});
  EXPECT_EQ(losses({{"TAKE", 2.0f}}), Found{"wrong-kind TAKE"});
  EXPECT_EQ(losses({{"TAKE", 2.0}}), Found{"wrong-kind TAKE"});
  EXPECT_EQ(losses({{"TAKE", "12"}}), Found{"wrong-kind TAKE"});
  EXPECT_EQ(losses({{"SATU", 1}}), Found{"wrong-kind SATU"});
  EXPECT_EQ(losses({{"SATU", 0.1}}), Found{"float-precision SATU"});
  EXPECT_EQ(losses({{"SATU", 0.5}}), Found{"float-precision SATU"});
  EXPECT_EQ(losses({{"SATU", std::numeric_limits<float>::quiet_NaN()}}), Found());
}

TEST(Losses, NamesListsOfFloatsByTheirCountAndTheirElements) {
  EXPECT_EQ(losses({{"WBAL", floats(3)}}), Found{"list-count WBAL"});
  EXPECT_EQ(losses({{"DASF", floats(2)}}), Found());
  EXPECT_EQ(losses({{"DASF", floats(3)}}), Found{"list-count DASF"});
  EXPECT_EQ(losses({{"WBAL", 3}}), Found{"wrong-kind WBAL"});
  EXPECT_EQ(losses({{"RGBG", Array::of(0.5f, 0.25, 1)}}),
            (Found{"float-precision RGBG[1]", "wrong-kind RGBG[2]"}));
}

TEST(Losses, NamesListsOfIntegers) {
  EXPECT_EQ(losses({{"BADP", Array::of(1, 2)}}), Found{"int-array BADP"});
  EXPECT_EQ(losses({{"BADP", Array::of(0, 0)}}), Found());
  EXPECT_EQ(losses({{"BADP", Array::of(1.0f)}}), Found{"wrong-kind BADP[0]"});
  EXPECT_EQ(losses({{"BADP", 1}}), Found{"wrong-kind BADP"});
  EXPECT_EQ(losses({{"SCPg", Array::of(1, std::int64_t{1} << 40)}}), Found{"int-range SCPg[1]"});
  EXPECT_EQ(losses({{"SCPg", Array()}}), Found{"list-empty SCPg"});
}

TEST(Losses, NamesListsOfTexts) {
  EXPECT_EQ(losses({{"KWRd", Array::of("four", "one")}}), Found{"list-pads KWRd[1]"});
  EXPECT_EQ(losses({{"KWRd", Array::of("one\0"sv, "a\0bc"sv)}}), Found());
  EXPECT_EQ(losses({{"KWRd", Array::of(letters(255))}}), Found{"list-pads KWRd[0]"});
  EXPECT_EQ(losses({{"KWRd", Array::of(letters(256))}}), Found{"text-long KWRd[0]"});
  EXPECT_EQ(losses({{"KWRd", Array::of("a\0"s + letters(300))}}), Found{"text-long KWRd[0]"});
  EXPECT_EQ(losses({{"KWRd", Array::of("Caf\xC3\xA9")}}), Found{"text-nonascii KWRd[0]"});
  EXPECT_EQ(losses({{"KWRd", Array::of("\xC3\xA9" + letters(300))}}),
            Found{"text-nonascii KWRd[0]"});
  EXPECT_EQ(losses({{"KWRd", Array::of("four", 4)}}), Found{"wrong-kind KWRd[1]"});
  EXPECT_EQ(losses({{"KWRd", Array()}}), Found{"list-empty KWRd"});
  EXPECT_EQ(losses({{"KWRd", "four"}}), Found{"wrong-kind KWRd"});
}

TEST(Losses, NamesUnalignedDataThatSomethingFollows) {
  const Dictionary followed = {{"FREE", bytes(5)}, {"TAKE", 1}};
  EXPECT_EQ(losses(followed), Found{"data-unaligned FREE!"});
  EXPECT_EQ(losses(followed, Layout::readable), Found());
  EXPECT_EQ(losses({{"TAKE", 1}, {"FREE", bytes(5)}}), Found());
  EXPECT_EQ(losses({{"PRCS", 1}, {"FREE", bytes(5)}}), Found());  // PRCS is written first
  EXPECT_EQ(losses({{"FREE", bytes(5)}, {"PRCS", 1}}), Found());
  EXPECT_EQ(losses({{"FREE", bytes(8)}, {"TAKE", 1}}), Found());
}

TEST(Losses, NamesUnalignedDataAmongWhatDoesNoDamage) {
  EXPECT_EQ(losses({{"FREE", bytes(5)}, {"ZZZZ", 1}, {"TAKE", 1}}),
            (Found{"unknown-tag ZZZZ", "data-unaligned FREE!"}));
  const Dictionary nested = {{"TAKE", 1}};
  const Value point = Dictionary{{"TAKE", 1}, {"CTLPData", Array::of(1, 2)}};
  EXPECT_EQ(losses({{"DSPm", Array::of(nested)}, {"FREE", bytes(5)}, {"COL1", nested}}),
            Found{"data-unaligned FREE!"});
  EXPECT_EQ(losses({{"FREE", bytes(5)}, {"CTLp", Array::of(point)}}),
            Found{"data-unaligned FREE!"});
}

TEST(Losses, NamesTheNestedStreamWhoseDataMakeItUnaligned) {
  const Value nested = Dictionary{{"FREE", bytes(5)}};
  EXPECT_EQ(losses({{"COL1", nested}}), Found());
  EXPECT_EQ(losses({{"COL1", nested}, {"COL2", Dictionary{{"TAKE", 1}}}}),
            Found{"data-unaligned COL1!"});
  EXPECT_EQ(
      losses({{"CTLp", Array::of(Dictionary{{"FREE", bytes(5)}, {"CTLPData", Array::of(1, 2)}},
                                 Dictionary{{"TAKE", 1}, {"CTLPData", Array::of(3, 4)}})}}),
      Found{"data-unaligned CTLp[0]!"});
  EXPECT_EQ(
      losses({{"CTLp", Array::of(Dictionary{{"FREE", bytes(8)}, {"CTLPData", Array::of(1, 2)}},
                                 Dictionary{{"GAIN", -1}, {"CTLPData", Array::of(3, 4)}})}}),
      Found{"int-range CTLp[1]/GAIN"});
  // Elements of DSPm are padded in both layouts.
  EXPECT_EQ(losses({{"DSPm", Array::of(nested, Dictionary{{"TAKE", 1}})}}), Found());
}

TEST(Losses, NamesSizesThatKeepSixteenBits) {
  EXPECT_EQ(losses({{"FREE", bytes(65536)}}), Found{"size-16bit FREE!"});
  EXPECT_EQ(losses({{"FREE", bytes(65536)}}, Layout::readable), Found());
  EXPECT_EQ(losses({{"FREE", bytes(65536)}, {"TAKE", 1}}), Found{"size-16bit FREE!"});
  EXPECT_EQ(losses({{"COL1", Dictionary{{"FREE", bytes(65528)}}}}), Found{"size-16bit COL1!"});
  EXPECT_EQ(losses({{"COL1", Dictionary{{"FREE", bytes(65524)}}}}), Found());
}

// Such a record would be read, and what follows it would not.
TEST(Losses, NamesWhatNoRecordThatIsSteppedOverHolds) {
  const std::size_t most = 0xFFFFF4;
  for (const Layout layout : {Layout::exact, Layout::readable}) {
    for (const std::size_t size : {most + 4, most + 8, most + 12}) {
      EXPECT_EQ(losses({{"FREE", bytes(size)}, {"TAKE", 1}}, layout), Found{"size-24bit FREE"})
          << size;
    }
    EXPECT_EQ(losses({{"COL1", Dictionary{{"FREE", bytes(most - 4)}}}}, layout),
              Found{"size-24bit COL1"});
    EXPECT_EQ(
        losses({{"SNID", Array(std::vector<Value>(most / 4 + 1, Value(7)))}, {"TAKE", 1}}, layout),
        Found{"size-24bit SNID"});
  }
  EXPECT_EQ(losses({{"GUID", bytes(most + 1)}}, Layout::readable), Found{"size-24bit GUID"});
  EXPECT_EQ(losses({{"FREE", bytes(most + 1)}, {"TAKE", 1}}),
            (Found{"size-24bit FREE", "data-unaligned FREE!"}));
  EXPECT_EQ(losses({{"FREE", bytes(most)}, {"TAKE", 1}}, Layout::readable), Found());
  EXPECT_EQ(
      losses({{"COL1", Dictionary{{"FREE", bytes(most - 8)}}}, {"COL2", Dictionary{{"TAKE", 1}}}},
             Layout::readable),
      Found());
}

// Nothing but its own size tells that it does harm: it is read as it was, for all are zeros.
TEST(Losses, NamesAListOfIntegersThatHidesWhatFollows) {
  const auto zeros = [](std::size_t count) { return Array(std::vector<Value>(count, Value(0))); };
  EXPECT_EQ(losses({{"SNID", zeros(0xFFFFF4 / 4)}, {"TAKE", 1}}), Found());
  EXPECT_EQ(losses({{"SNID", zeros(0xFFFFF4 / 4 + 1)}, {"TAKE", 1}}), Found{"size-24bit SNID"});
  EXPECT_EQ(losses({{"SNID", zeros(0xFFFFF4 / 4 + 1)}}), Found());
}

TEST(Losses, NamesGuidsThatAreNotOfSixteenBytes) {
  EXPECT_EQ(losses({{"GUID", bytes(16)}, {"TAKE", 1}}), Found());
  EXPECT_EQ(losses({{"GUID", bytes(24)}}), Found{"guid-length GUID!"});
  EXPECT_EQ(losses({{"GUID", bytes(5)}, {"TAKE", 1}}), Found{"guid-length GUID!"});
  EXPECT_EQ(losses({{"GUID", bytes(24)}, {"TAKE", 1}}, Layout::readable), Found());
  // What follows is only taken along, even if it would harm others.
  EXPECT_EQ(losses({{"GUID", bytes(4)}, {"ACDL", 0}, {"FREE", bytes(11)}}),
            Found{"guid-length GUID!"});
  EXPECT_EQ(losses({{"GUID", bytes(4)}, {"FREE", bytes(11)}, {"TAKE", 1}}),
            (Found{"guid-length GUID!", "data-unaligned FREE!"}));
  EXPECT_EQ(losses({{"GUID", "x"}}), Found{"wrong-kind GUID"});
}

TEST(Losses, NamesEntriesOfTheTagGroup) {
  const auto group = [](Dictionary entries) { return Dictionary{{"TAG ", std::move(entries)}}; };
  EXPECT_EQ(losses(group({})), Found{"empty-nested TAG "});
  EXPECT_EQ(losses(group({{"ISO", 2.5f}})), Found{"wrong-kind TAG /ISO"});
  EXPECT_EQ(losses(group({{"ISO", std::int64_t{1} << 31}})), Found{"int-range TAG /ISO"});
  EXPECT_EQ(losses(group({{"Lens", "35mm\0"sv}})), Found{"text-nul TAG /Lens"});
  EXPECT_EQ(losses(group({{"Lens", "35\0mm"sv}})), Found());
  EXPECT_EQ(losses(group({{"Lens", "Caf\xC3\xA9"}})), Found{"text-nonascii TAG /Lens"});
  EXPECT_EQ(losses(group({{"Lens", letters(256)}})), Found{"text-long TAG /Lens"});
  EXPECT_EQ(losses(group({{"Lens", letters(255) + '\0'}})), Found{"text-long TAG /Lens"});
  EXPECT_EQ(losses(group({{"L\xC3\xA9ns", 1}})), Found{"text-nonascii TAG /L\xC3\xA9ns"});
  EXPECT_EQ(losses(group({{letters(256), 1}})), Found{"text-long TAG /" + letters(256)});
  EXPECT_EQ(losses(group({{"ISO\0"sv, 1}})), Found{"text-nul TAG /" + std::string("ISO\0", 4)});
  EXPECT_EQ(losses({{"TAG ", 1}}), Found{"wrong-kind TAG "});
}

TEST(Losses, NamesEntriesOfTheRegGroup) {
  const auto group = [](Dictionary entries) { return Dictionary{{"REG ", std::move(entries)}}; };
  EXPECT_EQ(losses(group({{"Model", "X"}})), Found{"reg-text REG /Model"});
  EXPECT_EQ(losses(group({{"Model", 7}})), Found{"name-grows REG /Model"});
  EXPECT_EQ(losses(group({{"Model", Value::derivedText("7")}})),
            (Found{"name-grows REG /Model", "wrong-kind REG /Model"}));
}

TEST(Losses, NamesTheOtherOneOfAPair) {
  EXPECT_EQ(losses({{"DTIN", 5}}), Found{"pair-added DTDR"});
  EXPECT_EQ(losses({{"DTFO", 5}}), Found{"pair-added DTFI"});
  EXPECT_EQ(losses({{"DTFI", 5}}), Found{"pair-added DTFO"});
  EXPECT_EQ(losses({{"DTIN", 5}, {"DTDR", 0}, {"GAIN", -1}}), Found{"int-range GAIN"});
  EXPECT_EQ(losses({{"COL1", Dictionary{{"DTDR", 5}}}}), Found{"pair-added COL1/DTIN"});
}

TEST(Losses, NamesControlPointsWithoutTheirTwoIntegers) {
  const auto points = [](Dictionary point) {
    return Dictionary{{"CTLp", Array::of(std::move(point))}};
  };
  EXPECT_EQ(losses(points({{"TAKE", 1}})), Found{"ctlp-data CTLp[0]/CTLPData"});
  EXPECT_EQ(losses(points({{"CTLPData", Array::of(1)}})), Found{"ctlp-data CTLp[0]/CTLPData"});
  EXPECT_EQ(losses(points({{"CTLPData", Array::of(1, 2.0f)}})),
            Found{"ctlp-data CTLp[0]/CTLPData"});
  EXPECT_EQ(losses(points({{"CTLPData", Array::of(1, 2)}})), Found());
  EXPECT_EQ(losses({{"CTLp", Array()}}), Found{"list-empty CTLp"});
  EXPECT_EQ(losses({{"CTLp", Array::of(5)}}), Found{"wrong-kind CTLp[0]"});
  EXPECT_EQ(losses({{"CTLp", 5}}), Found{"wrong-kind CTLp"});
}

TEST(Losses, NamesWhatNestedStreamsLose) {
  EXPECT_EQ(losses({{"COL1", Dictionary()}}), Found{"empty-nested COL1"});
  EXPECT_EQ(losses({{"COL1", 1}}), Found{"wrong-kind COL1"});
  EXPECT_EQ(losses({{"COL2", Dictionary{{"COL1", Dictionary{{"GAIN", -1}, {"TAKE", 1}}}}}}),
            Found{"int-range COL2/COL1/GAIN"});
  EXPECT_EQ(losses({{"DSPm", Array::of(Dictionary(), Dictionary{{"GAIN", -1}})}}),
            Found{"int-range DSPm[1]/GAIN"});
  EXPECT_EQ(losses({{"DSPm", Array()}}), Found{"list-empty DSPm"});
  EXPECT_EQ(losses({{"DSPm", 1}}), Found{"wrong-kind DSPm"});
}

TEST(Losses, NamesStreamsNestedTooDeep) {
  Dictionary tags = {{"TAKE", 1}};
  std::string path;
  for (int level = 1; level < 64; ++level) tags = {{"COL1", tags}};
  EXPECT_EQ(losses(tags), Found());
  tags = {{"COL1", tags}};
  for (int level = 0; level < 64; ++level) path += level == 0 ? "COL1" : "/COL1";
  EXPECT_EQ(losses(tags), Found{"too-deep " + path});
}

TEST(Losses, NamesElementsOfListsNestedTooDeep) {
  const Value point = Array::of(1, 2);
  const auto nest = [&](int depth, bool isControlPoint) {
    Dictionary tags = {{"TAKE", 1}};
    for (int level = 0; level < depth; ++level) {
      if (!isControlPoint) {
        tags = {{"DSPm", Array::of(tags)}};
        continue;
      }
      tags.set("CTLPData", point);
      tags = {{"CTLp", Array::of(tags)}};
    }
    return tags;
  };
  for (const bool isControlPoint : {false, true}) {
    std::string path;
    for (int level = 0; level < 64; ++level)
      path += std::string(level == 0 ? "" : "/") + (isControlPoint ? "CTLp[0]" : "DSPm[0]");
    EXPECT_EQ(losses(nest(63, isControlPoint)), Found()) << isControlPoint;
    EXPECT_EQ(losses(nest(64, isControlPoint)), Found{"too-deep " + path}) << isControlPoint;
  }
}

TEST(Losses, NamesStreamsTooShortToBeLoaded) {
  EXPECT_EQ(losses({{"KWRd", Array::of("")}}), Found{"short-stream KWRd"});
  EXPECT_EQ(losses({{"KWRd", Array::of("", "")}}), Found());
}

TEST(Losses, CodesReadBack) {
  for (int i = 0; i <= static_cast<int>(LossCode::notReadBack); ++i) {
    const auto code = static_cast<LossCode>(i);
    EXPECT_EQ(lossCodeOf(codeOf(code)), code);
  }
  EXPECT_FALSE(lossCodeOf("text"));
  EXPECT_FALSE(lossCodeOf(""));
}

TEST(Losses, NamesWhatAListHasInPlaceOfAValue) {
  const Dictionary tags = {{"REEL", "A001C002"}, {"KWRd", Array::of(Value())}};
  EXPECT_EQ(losses(tags), Found{"wrong-kind KWRd[0]"});
  EXPECT_TRUE(messageOf(tags).starts_with("is nothing")) << messageOf(tags);
}

TEST(Losses, SaysWhatStandsInPlaceOfAText) {
  const std::pair<Value, std::string> values[] = {
      {5, "is an integer"},        {0.5f, "is a float"},
      {0.5, "is a double"},        {bytes(4), "is data"},
      {Array::of(1), "is a list"}, {Dictionary{{"REEL", "A001"}}, "is a dictionary"},
  };
  for (const auto& [value, start] : values) {
    const Dictionary tags = {{"REEL", value}, {"TIMC", "01:00:00:00"}};
    EXPECT_TRUE(messageOf(tags).starts_with(start)) << messageOf(tags);
  }
}

}  // namespace
}  // namespace oxmv
