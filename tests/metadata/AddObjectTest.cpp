// Values by key: MetadataDictionary::addObject.

#include <cstdint>
#include <string>
#include <utility>
#include <vector>

#include <gtest/gtest.h>

#include "oxmv/metadata/MetadataDictionary.h"
#include "oxmv/metadata/TagTable.h"
#include "oxmv/values/Array.h"
#include "tests/support/Printing.h"

namespace oxmv {
namespace {

const std::vector<std::string> anyValueTags = {
    "ANKE", "ANKF", "ANKG", "ANKN", "ASPI", "ATC1", "ATC2", "ATC3", "ATC4", "ATC5", "AUDI", "CAML",
    "CMDL", "COL1", "COL2", "CTLp", "DATE", "DFFM", "DFMT", "DFNT", "DISK", "DPNG", "DPXF", "DSCP",
    "DSCR", "DSPm", "FIRM", "GPST", "INKD", "INKE", "INKF", "INKG", "INKN", "KNDU", "KNEN", "KNST",
    "LABR", "LCNS", "LKEX", "LOGC", "LOOK", "NAME", "PULI", "PULO", "REEA", "REEL", "SCES", "SDAT",
    "SDUR", "SEND", "SNID", "SOUN", "SPIO", "STIM", "TAPE", "TC24", "TC25", "TC30", "TC3N", "TC4A",
    "TC5P", "TC60", "TIMA", "TIMC", "TIME", "TIMF", "TIMS", "TRNS", "UNCP", "VFXF", "VFXR",
};

const std::vector<std::string> numberTags = {
    "ACDL", "AFFI", "ASCS", "ATZM", "BFMT", "BLSH", "BMTX", "CACT", "CADN", "CALI", "CAMR", "CCRV",
    "CHFP", "CHNL", "CLSF", "CLSR", "CLSY", "CMIX", "CMVL", "CPUM", "CQUL", "CSWP", "CTRS", "CV67",
    "DCRV", "DEMO", "DFSZ", "DJST", "DPLX", "DSWD", "DTAG", "DTDR", "DTFI", "DTFO", "DTIN", "DXPS",
    "DYPS", "DZOM", "ECRV", "EXPS", "FORC", "GAIN", "HIST", "HOFF", "HPNT", "HSAT", "IGNR", "KNED",
    "KYST", "LCRC", "LYUV", "MDFr", "MRKG", "MSKL", "MSKR", "NUMC", "OFFC", "OFFD", "OFFH", "OFFR",
    "OFFW", "OFFX", "OFFY", "OVER", "PCRV", "PF3D", "PIXR", "PRCS", "PRNT", "PROJ", "ROFF", "SATU",
    "SCEN", "SHOT", "SHUT", "SMCR", "SMSG", "SMVD", "SPIP", "SPLT", "SUBT", "TAKE", "TILT", "TIMB",
    "TIMD", "TOOL", "UFRM", "VCHN", "VGNE", "VGNG", "VGNS", "VOFF", "VTSP", "WVFM", "ZOOM",
};

const std::vector<std::pair<std::string, std::size_t>> arrayTags = {
    {"ASCM", 9}, {"COLM", 12}, {"DASF", 2}, {"DBCL", 4}, {"DFCL", 4}, {"DPNS", 2}, {"DPOS", 2},
    {"DSCL", 4}, {"DTSF", 2},  {"GAMT", 3}, {"MASK", 8}, {"RGBG", 3}, {"RGBO", 3}, {"WBAL", 4}};

const std::vector<std::string> dataTags = {"DPXI", "DPXM", "DPXO", "DPXT",
                                           "DPXU", "FREE", "GUID", "NOPP"};

Value arrayOf(std::size_t count) { return Array(std::vector<Value>(count, Value(0.5f))); }

Value dictionaryOf(std::size_t count) {
  Dictionary made;
  for (std::size_t i = 0; i < count; ++i) made.set(std::to_string(i), 1);
  return made;
}

// One value of each kind, by the name of the kind.
std::vector<std::pair<std::string, Value>> oneOfEachKind() {
  const std::vector<std::uint8_t> bytes(24, 7);
  return {{"integer", 7},
          {"float", 0.5f},
          {"double", 0.25},
          {"text", "ABCD"},
          {"derived text", Value::derivedText("ABCD")},
          {"data", Value::data(bytes)},
          {"array", arrayOf(5)},
          {"dictionary", dictionaryOf(5)}};
}

// What `clip` answers, with the promise checked that comes with the answer: stored, or all as it
// was.
bool add(MetadataDictionary& clip, const Value& value, const std::string& key) {
  const Dictionary before = clip.metadata();
  const bool had = clip.haveMetadata();
  const bool added = clip.addObject(value, key);
  if (added) {
    EXPECT_EQ(clip.metadata()[key], value) << key;
    EXPECT_EQ(clip.metadata()[key].kind(), value.kind()) << key;
  } else {
    EXPECT_EQ(clip.metadata(), before) << key;
    EXPECT_EQ(clip.haveMetadata(), had) << key;
  }
  return added;
}

bool addToFresh(const Value& value, const std::string& key) {
  MetadataDictionary clip;
  return add(clip, value, key);
}

TEST(AddObject, KnowsEveryTagOnce) {
  EXPECT_EQ(anyValueTags.size(), 71u);
  EXPECT_EQ(numberTags.size(), 95u);
  EXPECT_EQ(arrayTags.size(), 14u);
  EXPECT_EQ(dataTags.size(), 8u);
}

TEST(AddObject, TakesAnyValueUnderTheFreeTags) {
  for (const std::string& tag : anyValueTags) {
    for (const auto& [kind, value] : oneOfEachKind())
      EXPECT_TRUE(addToFresh(value, tag)) << tag << ' ' << kind;
    EXPECT_FALSE(addToFresh(Value(), tag)) << tag;
  }
}

TEST(AddObject, TakesOnlyNumbersUnderTheNumberTags) {
  for (const std::string& tag : numberTags) {
    for (const auto& [kind, value] : oneOfEachKind()) {
      const bool isNumber = kind == "integer" || kind == "float" || kind == "double";
      EXPECT_EQ(addToFresh(value, tag), isNumber) << tag << ' ' << kind;
    }
    EXPECT_FALSE(addToFresh(Value(), tag)) << tag;
  }
}

TEST(AddObject, TakesArraysOfTheRightCountUnderTheArrayTags) {
  for (const auto& [tag, count] : arrayTags) {
    for (std::size_t size = 0; size <= 13; ++size) {
      EXPECT_EQ(addToFresh(arrayOf(size), tag), size == count) << tag << ' ' << size;
    }
    for (const auto& [kind, value] : oneOfEachKind())
      EXPECT_FALSE(addToFresh(value, tag)) << tag << ' ' << kind;
    EXPECT_FALSE(addToFresh(Value(), tag)) << tag;
  }
}

TEST(AddObject, LooksAtNoElementOfAnArray) {
  EXPECT_TRUE(addToFresh(Array::of("one", Array(), Dictionary()), "RGBG"));
}

// A dictionary is asked for its count like an array: it passes here, and the encoder leaves it out.
TEST(AddObject, KeepsADictionaryOfTheRightCountUnderAnArrayTag) {
  for (const auto& [tag, count] : arrayTags) {
    EXPECT_TRUE(addToFresh(dictionaryOf(count), tag)) << tag;
    EXPECT_FALSE(addToFresh(dictionaryOf(count + 1), tag)) << tag;
  }
}

// Data enters a dictionary by decoding or as part of a whole dictionary, never by key.
TEST(AddObject, KeepsRefusingEveryValueUnderTheDataTags) {
  for (const std::string& tag : dataTags) {
    for (const auto& [kind, value] : oneOfEachKind())
      EXPECT_FALSE(addToFresh(value, tag)) << tag << ' ' << kind;
    EXPECT_FALSE(addToFresh(Value(), tag)) << tag;
  }
}

// DTAG is a text everywhere else.
TEST(AddObject, KeepsTakingOnlyANumberUnderDTAG) {
  EXPECT_FALSE(addToFresh("ABCD", "DTAG"));
  EXPECT_TRUE(addToFresh(7, "DTAG"));
}

TEST(AddObject, RefusesEveryOtherTagOfTheTable) {
  std::size_t others = 0;
  for (const TagRow& row : tagRows()) {
    const auto characters = charactersOf(row.tag);
    const std::string tag(characters.data(), characters.size());
    const auto has = [&](const auto& tags) {
      return std::find(tags.begin(), tags.end(), tag) != tags.end();
    };
    const bool isArray = std::any_of(arrayTags.begin(), arrayTags.end(),
                                     [&](const auto& known) { return known.first == tag; });
    if (has(anyValueTags) || has(numberTags) || has(dataTags) || isArray) continue;
    ++others;
    for (const auto& [kind, value] : oneOfEachKind())
      EXPECT_FALSE(addToFresh(value, tag)) << tag << ' ' << kind;
  }
  EXPECT_EQ(others, 22u);  // 210 rows without the 188
}

TEST(AddObject, RefusesKeysThatAreNoTags) {
  for (const char* key :
       {"", "A", "REE", "REEL ", "reel", "ZZZZ", "TAG ", "REG ", "BADP", "SCPg", "CTLPData",
        "White balance", "CTLP", "ctlp", "R\xC3\xA9L", "\xFF\xFF\xFF\xFF"}) {
    for (const auto& [kind, value] : oneOfEachKind())
      EXPECT_FALSE(addToFresh(value, key)) << key << ' ' << kind;
  }
  EXPECT_FALSE(addToFresh(1, std::string("REE\0", 4)));
  EXPECT_TRUE(addToFresh(Array(), "CTLp"));
}

TEST(AddObject, ReplacesAnEarlierValueInItsPlace) {
  MetadataDictionary clip;
  EXPECT_TRUE(add(clip, "A001", "REEL"));
  EXPECT_TRUE(add(clip, 3, "TAKE"));
  EXPECT_TRUE(add(clip, 5, "REEL"));
  EXPECT_EQ((*clip.metadata().begin()).key, "REEL");
  EXPECT_EQ(clip.metadata(), (Dictionary{{"REEL", 5}, {"TAKE", 3}}));
}

TEST(AddObject, LeavesAnEarlierValueWhenItRefuses) {
  MetadataDictionary clip;
  EXPECT_TRUE(add(clip, arrayOf(8), "MASK"));
  EXPECT_FALSE(add(clip, arrayOf(7), "MASK"));
  EXPECT_FALSE(add(clip, arrayOf(9), "MASK"));
  EXPECT_FALSE(add(clip, "1.0", "GAIN"));
  EXPECT_EQ(clip.metadata(), (Dictionary{{"MASK", arrayOf(8)}}));
}

TEST(AddObject, LeavesTheCallersDictionaryAlone) {
  const Dictionary given = {{"REEL", "A001"}};
  MetadataDictionary clip;
  clip.setMetadata(given);
  const Dictionary handedOut = clip.metadata();
  EXPECT_TRUE(clip.addObject(3, "TAKE"));
  EXPECT_EQ(given.size(), 1u);
  EXPECT_EQ(handedOut.size(), 1u);
  EXPECT_EQ(clip.metadata().size(), 2u);
}

}  // namespace
}  // namespace oxmv
