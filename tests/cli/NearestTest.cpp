#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "cli/Nearest.h"

namespace oxmv::cli::test {
namespace {

using Names = std::vector<std::string_view>;

const Names names = {"show", "dump", "check", "encode", "REEL", "REEA"};

TEST(Nearest, ForgivesASlip) {
  EXPECT_EQ(nearest("shwo", names), Names{"show"});   // swapped
  EXPECT_EQ(nearest("shw", names), Names{"show"});    // left out
  EXPECT_EQ(nearest("shoow", names), Names{"show"});  // put in
  EXPECT_EQ(nearest("shaw", names), Names{"show"});   // another
}

TEST(Nearest, PutsTheNearestFirst) {
  EXPECT_EQ(nearest("reel", names), (Names{"REEL", "REEA"}));
  EXPECT_EQ(nearest("reea", names), (Names{"REEA", "REEL"}));
}

TEST(Nearest, TakesStarts) { EXPECT_EQ(nearest("enc", names), Names{"encode"}); }

TEST(Nearest, NamesAtMostThree) {
  EXPECT_EQ(nearest("a", Names{"ab", "ac", "ad", "ae"}), (Names{"ab", "ac", "ad"}));
}

TEST(Nearest, NamesNothingThatIsFarAway) {
  EXPECT_EQ(nearest("frobnicate", names), Names{});
  EXPECT_EQ(nearest("", names), Names{});
  EXPECT_EQ(nearest(std::string(100000, 's'), names), Names{});
}

TEST(Nearest, AsksInWords) {
  EXPECT_EQ(didYouMean(Names{}), "");
  EXPECT_EQ(didYouMean(Names{"a"}), "; did you mean a?");
  EXPECT_EQ(didYouMean(Names{"a", "b", "c"}), "; did you mean a, b or c?");
}

}  // namespace
}  // namespace oxmv::cli::test
