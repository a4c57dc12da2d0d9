#include <atomic>
#include <string>
#include <thread>
#include <utility>
#include <vector>

#include <gtest/gtest.h>

#include "oxmv/metadata/MetadataDictionary.h"
#include "oxmv/metadata/TagLabels.h"
#include "tests/support/Printing.h"

namespace oxmv {
namespace {

const std::vector<std::pair<std::string, std::string>> labels = {
    {"COLM", "Color Matrix"},      {"BMTX", "Unity Matrix"},     {"SATU", "Saturation"},
    {"BLSH", "BlurSharpen"},       {"RGBG", "RGB Gain"},         {"RGBO", "RGB Black Offset"},
    {"TIMC", "Timecode"},          {"TIMA", "Timecode ALT"},     {"TIMB", "Timecode Base"},
    {"TIMD", "TC Dropframe"},      {"REEL", "Reel name"},        {"REEA", "Reel name ALT"},
    {"LOGC", "Log comment"},       {"WBAL", "White balance"},    {"LOOK", "LOOK file"},
    {"LCRC", "LOOK CRC"},          {"ECRV", "Encode Curve"},     {"DCRV", "Decode Curve"},
    {"CCRV", "Primaries Curve"},   {"TAKE", "Take number"},      {"SHOT", "Shot number"},
    {"SCEN", "Scene number"},      {"PROJ", "Project number"},   {"CAMR", "Camera number"},
    {"DATE", "Encode Date"},       {"TIME", "Encode Time"},      {"SDAT", "Source Date"},
    {"STIM", "Source Time"},       {"PRNT", "Fingerprint"},      {"PIXR", "Pixel ratio"},
    {"BFMT", "Bayer format"},      {"SUBT", "OXMV subtype"},     {"GAMT", "Channel gamma"},
    {"MKGD", "Mark good take"},    {"UFRM", "Unique frame num"}, {"GAIN", "Camera gain"},
    {"SHUT", "Shutter speed"},     {"CLSY", "Color space YUV"},  {"CLSR", "Color space RGB"},
    {"PCRV", "Encode preset"},     {"ANKE", "Aux Ink out"},      {"ANKF", "Aux Ink film type"},
    {"ANKG", "Aux Ink edge type"}, {"ANKN", "Aux Ink"},          {"ASCM", "ASC_SOP"},
    {"ASCS", "ASC_SAT"},
};

TEST(TagLabels, GivesTheLabelOfEveryTagThatHasOne) {
  EXPECT_EQ(labels.size(), 46u);
  for (const auto& [tag, label] : labels) {
    const auto found = MetadataDictionary::translateTag(tag);
    ASSERT_NE(found, nullptr) << tag;
    EXPECT_EQ(*found, label);
  }
}

TEST(TagLabels, GivesNothingForEverythingElse) {
  for (const char* key : {"", "satu", "SATU ", "SAT", " SATU", "NAME", "ZZZZ", "TAG ",
                          "Color Matrix", "Saturation"}) {
    EXPECT_EQ(MetadataDictionary::translateTag(key), nullptr) << key;
  }
}

// The tag that is written has no label, and the tag that has the label is never written.
TEST(TagLabels, KeepsTheLabelOfMarkGoodTakeUnderMKGD) {
  EXPECT_EQ(MetadataDictionary::translateTag("MRKG"), nullptr);
  EXPECT_EQ(*MetadataDictionary::translateTag("MKGD"), "Mark good take");
}

TEST(TagLabels, HandsOutTheSameLabelUntilAnObjectIsMade) {
  const auto first = MetadataDictionary::translateTag("COLM");
  EXPECT_EQ(MetadataDictionary::translateTag("COLM"), first);
}

TEST(TagLabels, KeepsMakingTheTableAnewAfterEveryInit) {
  const auto first = MetadataDictionary::translateTag("COLM");
  MetadataDictionary clip;
  const auto second = MetadataDictionary::translateTag("COLM");
  EXPECT_NE(second, first);
  clip.init();
  const auto third = MetadataDictionary::translateTag("COLM");
  EXPECT_NE(third, second);
  EXPECT_EQ(*first, "Color Matrix");  // handed out, so still whole
  EXPECT_EQ(*second, "Color Matrix");
  EXPECT_EQ(*third, "Color Matrix");
}

TEST(TagLabels, LeavesTheTableAloneWhenAnObjectIsCopied) {
  const MetadataDictionary clip;
  const auto first = MetadataDictionary::translateTag("COLM");
  const MetadataDictionary copy = clip;
  EXPECT_FALSE(copy.haveMetadata());
  EXPECT_EQ(MetadataDictionary::translateTag("COLM"), first);
}

TEST(TagLabels, AnswersSeveralThreadsAtOnce) {
  std::atomic<int> right = 0;
  const auto work = [&] {
    for (int i = 0; i < 500; ++i) {
      MetadataDictionary clip;
      const auto label = MetadataDictionary::translateTag("WBAL");
      clip.init();
      if (label != nullptr && *label == "White balance") ++right;
    }
  };
  std::vector<std::thread> threads;
  for (int i = 0; i < 4; ++i) threads.emplace_back(work);
  for (std::thread& thread : threads) thread.join();
  EXPECT_EQ(right, 2000);
}

}  // namespace
}  // namespace oxmv
