#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "cli/Flags.h"

namespace oxmv::cli::test {
namespace {

using Words = std::vector<std::string>;

Arguments parse(std::vector<const char*> words) {
  words.insert(words.begin(), "oxmv");
  return Arguments::parse(words);
}

TEST(Flags, AreFoundAnywhere) {
  const Arguments arguments = parse({"--json", "show", "-q", "a", "--layout=readable", "b"});
  EXPECT_EQ(arguments.words(), (Words{"show", "a", "b"}));
  EXPECT_TRUE(arguments.has(Flag::json));
  EXPECT_TRUE(arguments.has(Flag::quiet));
  EXPECT_FALSE(arguments.has(Flag::verbose));
  EXPECT_EQ(arguments.value(Flag::layout), "readable");
}

TEST(Flags, TakeTheirValuesInEveryForm) {
  for (const auto& words :
       {std::vector<const char*>{"-o", "x"}, {"-ox"}, {"--output", "x"}, {"--output=x"}}) {
    EXPECT_EQ(parse(words).value(Flag::output), "x");
    EXPECT_EQ(parse(words).words(), Words{});
  }
  EXPECT_EQ(parse({"-o", "-"}).value(Flag::output), "-");
  EXPECT_EQ(parse({"-o", "[a,b]"}).value(Flag::output), "[a,b]");
}

TEST(Flags, CountOnceOrAsOftenAsTheyAreGiven) {
  const Arguments arguments = parse({"--allow", "a", "x", "--allow=b", "-o", "c", "-o", "d"});
  EXPECT_EQ(arguments.values(Flag::allow), (Words{"a", "b"}));
  EXPECT_EQ(arguments.value(Flag::output), "d");
  EXPECT_EQ(arguments.words(), Words{"x"});
}

TEST(Flags, MayShareADash) {
  const Arguments arguments = parse({"-q0", "x"});
  EXPECT_TRUE(arguments.has(Flag::quiet));
  EXPECT_TRUE(arguments.has(Flag::null));
}

TEST(Flags, EndAtTwoDashes) {
  EXPECT_EQ(parse({"show", "--", "--json", "--", "-q"}).words(),
            (Words{"show", "--json", "--", "-q"}));
}

TEST(Flags, AreNotMistakenForWords) {
  EXPECT_EQ(parse({"show", "-", "", "[a,b]", "A=-1"}).words(),
            (Words{"show", "-", "", "[a,b]", "A=-1"}));
  EXPECT_THROW(parse({"-5"}), UsageError);
  EXPECT_THROW(parse({"---"}), UsageError);
}

TEST(Flags, ChooseAmongNames) {
  const std::vector<std::string_view> choices = {"auto", "always", "never"};
  EXPECT_EQ(parse({}).choice(Flag::color, choices), 0u);
  EXPECT_EQ(parse({"--color", "never"}).choice(Flag::color, choices), 2u);
  EXPECT_THROW(parse({"--color", "Never"}).choice(Flag::color, choices), UsageError);
}

TEST(Flags, SurviveACommandWithoutEvenItsName) { EXPECT_EQ(Arguments::parse({}).words(), Words{}); }

}  // namespace
}  // namespace oxmv::cli::test
