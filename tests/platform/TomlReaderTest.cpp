#include <string>

#include <gtest/gtest.h>

#include "oxmv/platform/TomlReader.h"
#include "oxmv/values/Array.h"
#include "tests/support/Decoding.h"
#include "tests/support/Printing.h"

namespace oxmv::test {
namespace {

Dictionary read(std::string_view text) {
  auto result = readToml(text);
  if (const auto* problem = std::get_if<TomlProblem>(&result)) {
    ADD_FAILURE() << problem->line << ':' << problem->column << ": " << problem->message;
    return {};
  }
  return std::get<Dictionary>(result);
}

TomlProblem problemIn(std::string_view text) {
  const auto result = readToml(text);
  const auto* problem = std::get_if<TomlProblem>(&result);
  return problem == nullptr ? TomlProblem{"none", 0, 0} : *problem;
}

TEST(TomlReader, TablesBecomeDictionaries) {
  EXPECT_EQ(read(""), Dictionary());
  EXPECT_EQ(
      read("text = \"a\"\nnumber = -7\nfraction = 0.5\n[table]\nlist = [1, \"two\", {x = 3}]"),
      (Dictionary{{"text", "a"},
                  {"number", -7},
                  {"fraction", 0.5},
                  {"table", Dictionary{{"list", Array::of(1, "two", Dictionary{{"x", 3}})}}}}));
}

TEST(TomlReader, KeysAreInAlphabeticalOrder) {
  EXPECT_EQ(keys(read("b = 1\na = 2\nc = 3")), (Names{"a", "b", "c"}));
}

TEST(TomlReader, WhatIsNoTomlIsRefusedWithItsPlace) {
  const auto problem = problemIn("a = 1\nb = \n");
  EXPECT_EQ(problem.line, 2U);
  EXPECT_NE(problem.message, "");
  EXPECT_NE(problemIn("a = 1\na = 2").message, "none");
  EXPECT_NE(problemIn(std::string_view("a = 1\0", 6)).message, "none");
}

TEST(TomlReader, OtherCharactersThanAsciiAreRefusedWithTheirPlace) {
  for (const char* text : {"a = 1\nb\xC3\xA9 = 2", "a = 1\n#\xC3\xA9", "a = 1\n1\xFF", "\n \x80"}) {
    const auto problem = problemIn(text);
    EXPECT_EQ(problem.message, "only ASCII has a place here") << text;
    EXPECT_EQ(problem.line, 2U) << text;
    EXPECT_EQ(problem.column, 2U) << text;
  }
  EXPECT_EQ(problemIn("\xFF").column, 1U);
  EXPECT_EQ(read("a = \"\\u00E9\""), (Dictionary{{"a", "\xC3\xA9"}}));
}

// Where the reader behind asserts what no text has promised.
TEST(TomlReader, BracketsWithoutAKeyAreRefused) {
  for (const char* text : {"[(", "[[(", "[(a]", "[ =", "a.= 1", "= 1", "[.a]"}) {
    EXPECT_NE(problemIn(text).message, "none") << text;
  }
}

TEST(TomlReader, BooleansAndDatesAreRefusedWithTheirPlace) {
  const auto boolean = problemIn("a = 1\nb = true\n");
  EXPECT_EQ(boolean.message, "a boolean has no place here");
  EXPECT_EQ(boolean.line, 2U);
  EXPECT_EQ(boolean.column, 5U);
  EXPECT_EQ(problemIn("a = [[2024-02-29]]").message, "a date or time has no place here");
  EXPECT_EQ(problemIn("[a]\nb = 14:03:59").message, "a date or time has no place here");
  EXPECT_EQ(problemIn("a = 2024-02-29T14:03:59Z").message, "a date or time has no place here");
}

TEST(TomlReader, ATextOf64KibibytesIsReadAndALargerOneIsNot) {
  std::string text = "a = 1 #";
  text.resize(maxTomlSize, ' ');
  EXPECT_EQ(read(text), (Dictionary{{"a", 1}}));
  text += ' ';
  EXPECT_EQ(problemIn(text).message, "larger than 64 KiB");
}

// Deep nesting costs whoever reads it stack, also where it is only keys with points in them.
TEST(TomlReader, NestingIsLimited) {
  std::string keys = "a";
  for (std::size_t i = 0; i < maxTomlOpenings; ++i) keys += ".a";
  EXPECT_EQ(read(keys + "=1").size(), 1U);
  EXPECT_EQ(problemIn(keys + ".a=1").message, "more than 256 points and opening brackets");
  EXPECT_EQ(problemIn("a = " + std::string(maxTomlOpenings + 1, '[')).message,
            "more than 256 points and opening brackets");
  EXPECT_NE(problemIn("a = " + std::string(maxTomlOpenings, '[')).message, "none");
}

}  // namespace
}  // namespace oxmv::test
