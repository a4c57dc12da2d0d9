#include <algorithm>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "oxmv/looks/LongRuns.h"

namespace oxmv {
namespace {

const std::string run(minLongRun, 'A');

// Looks with both kinds of instructions, which must agree.
Skeleton skeletonOf(std::string_view document) {
  Skeleton plain = withoutLongRuns(document, Instructions::portable);
  const Skeleton fast = withoutLongRuns(document, Instructions::vector);
  EXPECT_EQ(plain.text, fast.text);
  EXPECT_EQ(plain.places, fast.places);
  EXPECT_EQ(plain.runs.size(), fast.runs.size());
  for (std::size_t i = 0; i < std::min(plain.runs.size(), fast.runs.size()); ++i) {
    EXPECT_EQ(plain.runs[i].offset, fast.runs[i].offset);
    EXPECT_EQ(plain.runs[i].text, fast.runs[i].text);
  }
  return plain;
}

TEST(LongRuns, AreReplacedByOneCharacter) {
  const std::string document = "<a>" + run + "</a>";
  const Skeleton skeleton = skeletonOf(document);
  EXPECT_EQ(skeleton.text, "<a>0</a>");
  ASSERT_EQ(skeleton.runs.size(), 1u);
  EXPECT_EQ(skeleton.runs[0].offset, 3u);
  EXPECT_EQ(skeleton.runs[0].text.data(), document.data() + 3);
  EXPECT_EQ(skeleton.runs[0].text.size(), run.size());
  EXPECT_EQ(skeleton.places, (std::vector<std::size_t>{3}));
}

TEST(LongRuns, ComeInTheirOrder) {
  const Skeleton skeleton = skeletonOf("<a>" + run + "<b>x</b>" + run + run + "</a>\n");
  EXPECT_EQ(skeleton.text, "<a>0<b>x</b>0</a>\n");
  EXPECT_EQ(skeleton.places, (std::vector<std::size_t>{3, 12}));
  EXPECT_EQ(skeleton.runs.at(1).text.size(), 2 * run.size());
}

TEST(LongRuns, ShorterOnesStay) {
  EXPECT_TRUE(skeletonOf("<a>" + run.substr(1) + "</a>").runs.empty());
  EXPECT_TRUE(skeletonOf("<a></a>").runs.empty());
  EXPECT_TRUE(skeletonOf("").runs.empty());
  EXPECT_TRUE(skeletonOf(">").runs.empty());
}

TEST(LongRuns, StandBetweenMarkup) {
  EXPECT_TRUE(skeletonOf(run + "<a/>").runs.empty());
  EXPECT_TRUE(skeletonOf("<a>" + run).runs.empty());
  EXPECT_TRUE(skeletonOf("<a>x" + run + "</a>").runs.empty());
  EXPECT_TRUE(skeletonOf("<a>" + run + "x</a>").runs.empty());
  EXPECT_TRUE(skeletonOf("<a>" + run + ">").runs.empty());
}

TEST(LongRuns, HoldTheseCharactersOnly) {
  for (int c = 0; c < 256; ++c) {
    for (const std::size_t at : {std::size_t{0}, std::size_t{700}, run.size() - 1}) {
      std::string text = run;
      text[at] = static_cast<char>(c);
      const bool isMember =
          c != 0 &&
          std::string_view("0123456789ABCDEFabcdef \t\r\n,\"'").find(static_cast<char>(c)) !=
              std::string_view::npos;
      const std::string document = "<a>" + text + "</a>";
      EXPECT_EQ(skeletonOf(document).runs.size(), isMember ? 1u : 0u) << c << " at " << at;
    }
  }
}

TEST(LongRuns, EndWhereTheyDo) {
  for (std::size_t more = 0; more < 70; ++more) {
    const Skeleton skeleton = skeletonOf("<a>" + run + std::string(more, '1') + "</a>");
    ASSERT_EQ(skeleton.runs.size(), 1u);
    EXPECT_EQ(skeleton.runs[0].text.size(), run.size() + more);
  }
}

}  // namespace
}  // namespace oxmv
