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

TEST(Flags, OfALetterTakeTheRestAsTheirValue) {
  const Arguments arguments = parse({"-qoa=b", "x"});
  EXPECT_TRUE(arguments.has(Flag::quiet));
  EXPECT_EQ(arguments.value(Flag::output), "a=b");
  EXPECT_EQ(arguments.words(), Words{"x"});
}

TEST(Flags, TakeAValueThatLooksLikeAFlag) {
  EXPECT_EQ(parse({"-o", "--json"}).value(Flag::output), "--json");
  EXPECT_FALSE(parse({"-o", "--json"}).has(Flag::json));
  EXPECT_EQ(parse({"--output", "--", "-q"}).value(Flag::output), "--");
  EXPECT_EQ(parse({"--output=-q"}).value(Flag::output), "-q");
}

std::string refusal(const std::vector<const char*>& words) {
  try {
    parse(words);
  } catch (const UsageError& error) {
    return error.what();
  }
  return {};
}

TEST(Flags, RefuseAMissingValue) {
  for (const char* word : {"-o", "-qo", "--output"})
    EXPECT_EQ(refusal({"show", word}), "--output needs OUT behind it");
}

TEST(Flags, RefuseAValueThatTheyDoNotTake) {
  EXPECT_EQ(refusal({"show", "--json=x"}), "--json takes no value");
}

TEST(Flags, RefuseWhatIsNoneOfThem) {
  EXPECT_EQ(refusal({"--jso"}), "no flag --jso; did you mean --json?");
  EXPECT_EQ(refusal({"--jso=x"}), "no flag --jso; did you mean --json?");
  EXPECT_EQ(refusal({"-qx"}), "no flag -x");
  EXPECT_EQ(refusal({"-xq"}), "no flag -xq");
  EXPECT_EQ(refusal({"-q=true"}), "no flag -");
  EXPECT_EQ(refusal({"--=x"}), "no flag --");
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
