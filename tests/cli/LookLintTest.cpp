#include <string>
#include <utility>
#include <vector>

#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include "tests/cli/CommandRunner.h"
#include "tests/cli/LookFolder.h"

namespace oxmv::cli::test {
namespace {

using Json = nlohmann::json;
using Finding = std::pair<std::string, std::string>;  // "LINE:COLUMN", code
using Findings = std::vector<Finding>;

const std::string values = "0000803F0000003F0000803E";

// What lint finds in a description of this name.
Findings findingsIn(const std::string& content, const std::string& name = "warm.xml") {
  const LookFolder folder;
  const Outcome outcome = folder.run({"lint", "--json", folder.description(name, content)});
  EXPECT_EQ(outcome.err, "");
  Findings findings;
  const Json results = Json::parse(outcome.out);
  for (const Json& finding : results[0]["findings"]) {
    const std::string place =
        finding["line"].is_null() ? "-" : finding["line"].dump() + ':' + finding["column"].dump();
    findings.push_back({place, finding["code"]});
    EXPECT_FALSE(finding["message"].get<std::string>().empty());
  }
  EXPECT_EQ(outcome.exitCode, findings.empty() ? 0 : 1);
  return findings;
}

TEST(LookLint, SaysNothingWhenAllIsWell) {
  for (const char* sample : {"Identity-2", "Warm-17", "Night-33", "Film-wrapped-17",
                             "size-in-quotes", "table-in-cdata"}) {
    const Outcome outcome = run({"look", "lint", lookData + sample + ".xml"});
    EXPECT_EQ(outcome.exitCode, 0) << sample;
    EXPECT_EQ(outcome.out + outcome.err, "") << sample;
  }
}

TEST(LookLint, NamesFileLineAndColumn) {
  const std::string sample = lookData + "illegal/white-space-before-size.xml";
  const Outcome outcome = run({"look", "lint", sample});
  EXPECT_EQ(outcome.exitCode, 1);
  EXPECT_EQ(outcome.out,
            sample +
                ":1:12: white space before <size> counts as a table without a size: remove it,"
                " or import with --strip-space (space-before-size)\n");
}

TEST(LookLint, GivesItsFindingsAsJson) {
  const std::string sample = lookData + "illegal/size-65.xml";
  EXPECT_EQ(run({"look", "lint", "--ndjson", sample}).out,
            R"({"schema":"oxmv.look.lint/1","file":")" + sample +
                R"(","findings":[{"code":"size-too-large","line":1,"column":12,"stops":true,)"
                R"("message":"a size of 65: 64 points per axis are the most"}],"error":null})"
                "\n");
}

TEST(LookLint, FindsWhiteSpaceThatCountsAsTables) {
  EXPECT_EQ(
      findingsIn("<look>\n  <LUT>\n    <size>1</size>\n    <a>" + values +
                 "</a>\n  </LUT>\n</look>\n"),
      (Findings{
          {"2:8", "space-before-size"}, {"3:19", "space-as-table"}, {"4:36", "space-as-table"}}));
}

TEST(LookLint, FindsCommentsThatCountAsTables) {
  EXPECT_EQ(findingsIn(lut("<!-- warm --><size>1</size><!-- warm --><?p q?><a>" + values + "</a>")),
            (Findings{{"1:12", "comment-before-size"},
                      {"1:39", "comment-as-table"},
                      {"1:52", "comment-as-table"}}));
}

TEST(LookLint, FindsTablesWithoutASize) {
  EXPECT_EQ(findingsIn(lut("<a>" + values + "</a>")), (Findings{{"1:12", "table-before-size"}}));
  EXPECT_EQ(findingsIn(lut("<size>0</size><a>" + values + "</a>")),
            (Findings{{"1:12", "odd-size"}, {"1:26", "table-before-size"}}));
  // The size of one "LUT" is none for the next.
  EXPECT_EQ(
      findingsIn("<look><LUT><size>1</size><a>" + values + "</a></LUT><LUT><a/></LUT></look>"),
      (Findings{{"1:68", "table-before-size"}}));
}

TEST(LookLint, FindsSizesThatAreNot) {
  const auto withSize = [](const std::string& size) {
    return findingsIn(lut("<size>" + size + "</size><a>" + values + "</a>"));
  };
  const Findings odd = {{"1:12", "odd-size"}};
  EXPECT_EQ(withSize("\"1\""), Findings{});
  EXPECT_EQ(withSize("&quot;1&quot;"), Findings{});
  EXPECT_EQ(withSize("\n 1 "), Findings{});
  EXPECT_EQ(withSize("1x1x1"), odd);
  EXPECT_EQ(withSize("-1"), odd);
  EXPECT_EQ(withSize("+1"), odd);
  EXPECT_EQ(withSize("01"), odd);
  EXPECT_EQ(withSize("1.5"), odd);
  EXPECT_EQ(withSize("65"), (Findings{{"1:12", "size-too-large"}}));
  EXPECT_EQ(withSize("99999999999"), (Findings{{"1:12", "size-too-large"}}));
}

TEST(LookLint, FindsTooFewAndTooManyValues) {
  EXPECT_EQ(findingsIn(lut("<size>1</size><a>0000803F</a>")),
            (Findings{{"1:26", "too-few-values"}}));
  EXPECT_EQ(findingsIn(lut("<size>1</size>\n<a>" + values + " 0000803F</a>")),
            (Findings{{"1:26", "space-as-table"}, {"2:29", "too-many-values"}}));
}

TEST(LookLint, FindsMalformedGroups) {
  EXPECT_EQ(findingsIn(lut("<size>1</size><a>0000803F\n0000zz3F\n0000803E</a>")),
            (Findings{{"2:1", "malformed-group"}}));
  EXPECT_EQ(findingsIn(lut("<size>1</size><a>0000803F\r\n0000003F\r\n0000zz3E</a>")),
            (Findings{{"3:1", "malformed-group"}}));
  EXPECT_EQ(findingsIn(lut("<size>1</size><a>0000803F 0000003F 000080</a>")),
            (Findings{{"1:47", "malformed-group"}}));
  // Of a text that an entity is in nobody knows the places.
  EXPECT_EQ(findingsIn(lut("<size>1</size><a>0000803F&#32;0000zz3F 0000803E</a>")),
            (Findings{{"1:26", "malformed-group"}}));
}

TEST(LookLint, FindsWhatStandsBeforeAndBetweenTheValues) {
  EXPECT_EQ(findingsIn(lut("<size>1</size><a>\n   " + values + "\n   </a>")),
            (Findings{{"1:26", "long-start"}}));
  EXPECT_EQ(findingsIn(lut("<size>1</size><a>0000803F\u00A00000003F 0000803E</a>")),
            (Findings{{"1:26", "not-ascii"}}));
}

TEST(LookLint, FindsTablesWithoutValues) {
  EXPECT_EQ(findingsIn(lut("<size>1</size><a/><a>" + values + "</a>")),
            (Findings{{"1:26", "empty-table"}}));
  EXPECT_EQ(findingsIn(lut("<size>1</size><![CDATA[]]><a>" + values + "</a>")),
            (Findings{{"1:26", "empty-table"}}));
}

TEST(LookLint, FindsValuesThatAreNotFinite) {
  EXPECT_EQ(findingsIn(lut("<size>1</size><a>0000807F000080FF0000C07F</a>")),
            (Findings{{"1:26", "not-finite"}}));
  EXPECT_NE(run({"look", "lint", "-"}, lut("<size>1</size><a>0000803F3F8000000000C07F</a>"))
                .out.find("1 value is not finite, value 3 first, which is NaN"),
            std::string::npos);
}

TEST(LookLint, FindsTablesThatAreNotAloneOrTheSame) {
  EXPECT_EQ(findingsIn(lut("<size>1</size><a>" + values + "</a><a>" + values + "</a>")),
            (Findings{{"1:57", "same-values"}, {"1:57", "several-tables"}}));
  EXPECT_EQ(findingsIn("<look><LUT><size>1</size><a>" + values +
                       "</a></LUT><LUT><size>1</size><a>"
                       "0000803F0000803F0000803F</a></LUT></look>"),
            (Findings{{"1:82", "several-tables"}}));
}

TEST(LookLint, FindsDescriptionsWithoutATable) {
  EXPECT_EQ(findingsIn("<look/>"), (Findings{{"-", "no-table"}}));
  EXPECT_EQ(findingsIn("<look><LUT/></look>"), (Findings{{"1:7", "no-table"}}));
  EXPECT_EQ(findingsIn(lut("<size>2</size>")), (Findings{{"1:7", "no-table"}}));
}

TEST(LookLint, FindsElementsThatAreNotTakenForWhatTheyAre) {
  const std::string table = "<size>1</size><a>" + values + "</a>";
  EXPECT_EQ(findingsIn("<LUT>" + table + "</LUT>"), (Findings{{"1:1", "misplaced-lut"}}));
  EXPECT_EQ(findingsIn("<LUT><LUT>" + table + "</LUT></LUT>"), Findings{});
  EXPECT_EQ(findingsIn("<x><y><LUT>" + table + "</LUT></y></x>"),
            (Findings{{"1:7", "misplaced-lut"}}));
  EXPECT_EQ(findingsIn("<look><lut>" + table + "</lut></look>"),
            (Findings{{"1:7", "misspelt-lut"}}));
  EXPECT_EQ(findingsIn("<look xmlns:x='u'><x:LUT>" + table + "</x:LUT></look>"),
            (Findings{{"1:19", "misspelt-lut"}}));
  EXPECT_EQ(findingsIn(lut("<Size>1</Size><a>" + values + "</a>")),
            (Findings{{"1:12", "misspelt-size"},
                      {"1:12", "table-before-size"},
                      {"1:26", "table-before-size"}}));
}

TEST(LookLint, FindsNamesThatAreNotStored) {
  const std::string good = lut("<size>1</size><a>" + values + "</a>");
  EXPECT_EQ(findingsIn(good, std::string(38, 'n') + ".xml"), Findings{});
  EXPECT_EQ(findingsIn(good, std::string(39, 'n') + ".xml"), (Findings{{"-", "long-name"}}));
  EXPECT_EQ(findingsIn(good, "Caf\u00E9.xml"), (Findings{{"-", "name-not-ascii"}}));
}

TEST(LookLint, NamesThePlaceOfWhatIsNoXml) {
  EXPECT_EQ(findingsIn("<look>\n<LUT>\n</look>"), (Findings{{"3:3", "not-well-formed"}}));
  EXPECT_EQ(findingsIn(""), (Findings{{"1:1", "not-well-formed"}}));
}

TEST(LookLint, FindsMoreThanAnImportMayWrite) {
  // Each table its own value, 342 of the largest size.
  std::string tables = "<size>64</size>";
  const std::string digits = "0123456789ABCDEF";
  for (std::size_t i = 0; i < 342; ++i)
    tables +=
        std::string("<a>") + digits[i / 256] + digits[i / 16 % 16] + digits[i % 16] + "0803F</a>";
  const Findings findings = findingsIn(lut(tables));
  ASSERT_FALSE(findings.empty());
  EXPECT_EQ(findings.back().second, "too-much");
}

TEST(LookLint, ReadsNoMoreThanAHundredThousandTables) {
  std::string tables;
  for (int i = 0; i < 100001; ++i) tables += "<a/>";
  const LookFolder folder;
  const std::string file = folder.description("many.xml", lut(tables));
  const Outcome outcome = folder.run({"lint", file});
  ASSERT_EQ(linesOf(outcome.out).size(), 1u);
  EXPECT_NE(outcome.out.find("(too-many-tables)"), std::string::npos);
  EXPECT_EQ(folder.run({"import", file}).exitCode, 4);
}

TEST(LookLint, HidesWhatWouldDisturbATerminal) {
  const Outcome outcome = run({"look", "lint", "-"}, lut("<size>\u202E1</size>"));
  EXPECT_NE(outcome.out.find("\\u{202E}1"), std::string::npos) << outcome.out;
}

TEST(LookLint, NamesAFileThatCannotBeRead) {
  const Outcome outcome = run({"look", "lint", "/nonexistent/a.xml", "--json"});
  EXPECT_EQ(outcome.exitCode, 3);
  EXPECT_EQ(outcome.err, "oxmv: error: /nonexistent/a.xml: No such file or directory (missing)\n");
  EXPECT_TRUE(Json::parse(outcome.out)[0]["findings"].is_null());
}

}  // namespace
}  // namespace oxmv::cli::test
