#include <fstream>
#include <iterator>
#include <set>
#include <string>

#include <gtest/gtest.h>

#include "oxmv/import/CameraTables.h"

namespace oxmv {
namespace {

std::string builtInText() {
  std::ifstream file(OXMV_SOURCE_DIR "/oxmv/import/cameras.toml");
  return {std::istreambuf_iterator<char>(file), {}};
}

std::string with(const std::string& old, const std::string& fresh) {
  std::string text = builtInText();
  const auto at = text.find(old);
  EXPECT_NE(at, std::string::npos) << old;
  return at == std::string::npos ? text : text.replace(at, old.size(), fresh);
}

std::string problemOf(const std::string& text) {
  const auto read = CameraTables::fromText(text);
  const auto* problem = std::get_if<CameraTablesProblem>(&read);
  return problem == nullptr ? "none" : problem->message;
}

TEST(CameraTables, BuiltInOnesAreThoseOfTheFile) {
  const auto read = CameraTables::fromText(builtInText());
  ASSERT_TRUE(std::holds_alternative<CameraTables>(read)) << problemOf(builtInText());
  EXPECT_EQ(std::get<CameraTables>(read), CameraTables::builtIn());
}

TEST(CameraTables, RowsStandInTheOrderOfTheFile) {
  const CameraTables& tables = CameraTables::builtIn();
  EXPECT_EQ(tables.shortPrefixes()[0], (CameraTables::FirmwareRow{"QX1", "QX Alpha"}));
  EXPECT_EQ(tables.shortPrefixes()[1], (CameraTables::FirmwareRow{"QX2", "QX Beta"}));
  EXPECT_EQ(tables.longPrefixes()[0], (CameraTables::FirmwareRow{"QX3.01", "QX Gamma"}));
  EXPECT_EQ(tables.longPrefixes()[13], (CameraTables::FirmwareRow{"QZ1.01", "QZ Lambda"}));
  EXPECT_EQ(tables.modelTexts()[14],
            (CameraTables::ModelRow{"KV-QZ110", "QZ1.01.00.00", "QZ Lambda"}));
}

TEST(CameraTables, FirmwareOfAModelIsItsPrefixAndZeros) {
  const auto& rows = CameraTables::builtIn().modelTexts();
  EXPECT_EQ(rows[0].firmware, "QX1.00.00.00");
  EXPECT_EQ(rows[2].firmware, "QX3.01.00.00");
  for (const auto& row : rows) EXPECT_EQ(row.firmware.size(), 12U) << row.text;
}

TEST(CameraTables, KeepsTheSameNameInTwoRows) {
  const auto& rows = CameraTables::builtIn().longPrefixes();
  EXPECT_EQ(rows[0].name, rows[3].name);
  EXPECT_NE(rows[0].prefix, rows[3].prefix);
}

TEST(CameraTables, KeepsTheRepeatedPrefixOfTheLastRow) {
  const auto& rows = CameraTables::builtIn().longPrefixes();
  EXPECT_EQ(rows[12].prefix, rows[13].prefix);
  EXPECT_NE(rows[12].name, rows[13].name);
  std::set<std::string> prefixes;
  for (const auto& row : rows) prefixes.insert(row.prefix);
  EXPECT_EQ(prefixes.size(), rows.size() - 1);  // no other one is repeated
}

TEST(CameraTables, AnotherFileOfTheSameShapeIsTaken) {
  const auto read = CameraTables::fromText(with("\"QX Alpha\"", "\"QX Omega\""));
  ASSERT_TRUE(std::holds_alternative<CameraTables>(read));
  EXPECT_EQ(std::get<CameraTables>(read).shortPrefixes()[0].name, "QX Omega");
  EXPECT_EQ(std::get<CameraTables>(read).shortPrefixes()[1].name, "QX Beta");
}

TEST(CameraTables, DifferByWhatStandsInAnyOfTheTables) {
  const auto other = [](const std::string& old, const std::string& fresh) {
    return std::get<CameraTables>(CameraTables::fromText(with(old, fresh)));
  };
  const CameraTables& tables = CameraTables::builtIn();
  EXPECT_NE(tables, other("{prefix = \"QX2\"", "{prefix = \"QX9\""));
  EXPECT_NE(tables, other("\"QX Alpha\"", "\"QX Omega\""));
  EXPECT_NE(tables, other("{prefix = \"QZ1.01\"", "{prefix = \"QZ9.01\""));
  EXPECT_NE(tables, other("\"QX Gamma\"", "\"QX Omega\""));
  EXPECT_NE(tables, other("\"KV-QZ110\"", "\"KV-QZ119\""));
  const CameraTables::ModelRow row = {"KV-QZ110", "QZ1.01.00.00", "QZ Lambda"};
  EXPECT_NE(row, (CameraTables::ModelRow{"KV-QZ110", "QZ1.02.00.00", "QZ Lambda"}));
  EXPECT_NE(row, (CameraTables::ModelRow{"KV-QZ110", "QZ1.01.00.00", "QZ Omega"}));
}

TEST(CameraTables, WhatIsNoTomlIsRefusedWithItsPlace) {
  EXPECT_TRUE(problemOf("short-prefixes = [\n  {prefix = }\n]").starts_with("line 2: "))
      << problemOf("short-prefixes = [\n  {prefix = }\n]");
}

TEST(CameraTables, AHugeTextIsRefused) {
  EXPECT_EQ(problemOf(std::string(64 * 1024 + 1, '\n')), "larger than 64 KiB");
  EXPECT_EQ(problemOf(std::string(64 * 1024, '\n')), "short-prefixes has 0 rows, not 2");
}

TEST(CameraTables, ATextThatNestsIsRefused) {
  EXPECT_TRUE(problemOf("a = " + std::string(60'000, '[')).starts_with("line 1: nested deeper"));
}

TEST(CameraTables, ATableWithOtherRowsIsRefused) {
  EXPECT_EQ(problemOf(""), "short-prefixes has 0 rows, not 2");
  EXPECT_EQ(problemOf("short-prefixes = 2"), "short-prefixes has 0 rows, not 2");
  EXPECT_EQ(problemOf(with("  {prefix = \"QX2\", name = \"QX Beta\"},\n", "")),
            "short-prefixes has 1 row, not 2");
  EXPECT_EQ(problemOf(with("  {prefix = \"QZ1.01\", name = \"QZ Lambda\"},\n", "")),
            "long-prefixes has 13 rows, not 14");
  EXPECT_EQ(
      problemOf(with("  {text = \"KV-QX100\", prefix = \"QX1\", name = \"QX Alpha\"},\n", "")),
      "model-texts has 14 rows, not 15");
}

TEST(CameraTables, ARowOfTheWrongShapeIsNamed) {
  EXPECT_EQ(problemOf(with("{prefix = \"QX2\", name = \"QX Beta\"}", "\"QX2\"")),
            "short-prefixes, row 2: is not like {prefix = \"QX1\", name = \"QX Alpha\"}");
  EXPECT_EQ(problemOf(with("prefix = \"QX3.02\", ", "")),
            "long-prefixes, row 2: prefix is missing, or is no text");
  EXPECT_EQ(problemOf(with("prefix = \"QX3.02\"", "prefix = 3.02")),
            "long-prefixes, row 2: prefix is missing, or is no text");
  for (const char* noText : {"true", "false", "1979-05-27", "1979-05-27T07:32:00Z", "07:32:00"}) {
    EXPECT_EQ(problemOf(with("name = \"QX Delta\"", std::string("name = ") + noText)),
              "long-prefixes, row 3: name is missing, or is no text");
  }
  EXPECT_EQ(problemOf(with("name = \"QX Delta\"", "name = \"\"")),
            "long-prefixes, row 3: name is missing, or is no text");
  EXPECT_EQ(problemOf(with("name = \"QX Delta\"", "name = \"QX Delta\", note = \"\"")),
            "long-prefixes, row 3: has keys that have no place in it");
  EXPECT_EQ(problemOf(with("text = \"KV-QX301\"", "txt = \"KV-QX301\"")),
            "model-texts, row 3: text is missing, or is no text");
}

TEST(CameraTables, APrefixOfTheWrongFormIsNamed) {
  EXPECT_EQ(problemOf(with("prefix = \"QX2\"", "prefix = \"QX\"")),
            "short-prefixes, row 2: prefix \"QX\" is not of 3 characters");
  EXPECT_EQ(problemOf(with("prefix = \"QX2\"", "prefix = \"QX2.01\"")),
            "short-prefixes, row 2: prefix \"QX2.01\" is not of 3 characters");
  for (const char* prefix :
       {"QX3", "QX3.0", "QX3.011", "QX3-01", "Q13.01", "1X3.01", "QXX.01", "QX3.X1", "QX3.0X"}) {
    EXPECT_EQ(problemOf(with("\"QX3.01\"", '"' + std::string(prefix) + '"')),
              "long-prefixes, row 1: prefix \"" + std::string(prefix) + "\" is not like QX3.01");
  }
  for (const char* beside : {"@X3.01", "[X3.01", "`X3.01", "{X3.01", "QX/.01", "QX:.01"})
    EXPECT_NE(problemOf(with("\"QX3.01\"", '"' + std::string(beside) + '"')), "none") << beside;
  for (const char* prefix : {"AZ0.90", "az9.09"})
    EXPECT_EQ(problemOf(with("\"QX3.01\"", '"' + std::string(prefix) + '"')), "none") << prefix;
  EXPECT_EQ(problemOf(with("prefix = \"QX2\", name = \"QX Beta\"},\n  {text",
                           "prefix = \"QX22\", name = \"QX Beta\"},\n  {text")),
            "model-texts, row 2: prefix \"QX22\" is neither of 3 characters nor like QX3.01");
}

TEST(CameraTables, TextsOtherThanPrintableAsciiAreNamed) {
  EXPECT_EQ(problemOf(with("\"QX Beta\"", "\"QX B\\u00EAta\"")),
            "short-prefixes, row 2: name has other characters than printable ASCII");
  EXPECT_EQ(problemOf(with("\"QX Beta\"", "\"QX\\u0000Beta\"")),
            "short-prefixes, row 2: name has other characters than printable ASCII");
  EXPECT_EQ(problemOf(with("\"QX Beta\"", "\"QX\\u007FBeta\"")),
            "short-prefixes, row 2: name has other characters than printable ASCII");
  EXPECT_EQ(problemOf(with("\"QX Beta\"", "\"QX ~Beta\"")), "none");
  EXPECT_EQ(problemOf(with("\"QX2\"", "\"QX\\u00B2\"")),
            "short-prefixes, row 2: prefix has other characters than printable ASCII");
}

TEST(CameraTables, WhatStandsBesideTheTablesIsRefused) {
  EXPECT_EQ(problemOf(builtInText() + "long-prefix = []\n"),
            "something stands beside the three tables");
}

TEST(CameraTables, EveryShorterFileIsRefused) {
  std::string text = builtInText();
  text.erase(text.rfind(']'));  // the last character that counts
  for (; !text.empty(); text.pop_back()) ASSERT_NE(problemOf(text), "none") << text.size();
}

}  // namespace
}  // namespace oxmv
