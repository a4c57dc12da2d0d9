#include <string>

#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include "oxmv/metadata/TagTable.h"
#include "tests/cli/CommandRunner.h"

namespace oxmv::cli::test {
namespace {

using Json = nlohmann::ordered_json;

TEST(Tags, ListsEveryTag) {
  const Outcome outcome = run({"tags"});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_EQ(linesOf(outcome.out).size(), tagRows().size() + 1);
  EXPECT_EQ(outcome.err, "");
}

TEST(Tags, FindsByTagAndByLabelInAnyCase) {
  EXPECT_EQ(
      run({"tags", "white"}).out,
      "TAG   LABEL               READ AS                  WRITTEN AS          ACCEPTS BY KEY\n"
      "WBAL  White balance       4 floats                 f 16                array of 4\n");
  EXPECT_EQ(run({"tags", "wbal"}).out, run({"tags", "white"}).out);
  EXPECT_EQ(linesOf(run({"tags", "Reel name"}).out).size(), 3u);
}

TEST(Tags, NamesTheNearestWhenNothingMatches) {
  const Outcome outcome = run({"tags", "RELE"});
  EXPECT_EQ(outcome.exitCode, 1);
  EXPECT_EQ(outcome.out, "");
  EXPECT_EQ(outcome.err,
            "oxmv: error: no tag or label contains \"RELE\"; did you mean REEL (Reel name)?"
            " (unknown-tag)\n");
  EXPECT_EQ(run({"tags", "qqqqqq"}).err,
            "oxmv: error: no tag or label contains \"qqqqqq\" (unknown-tag)\n");
  EXPECT_EQ(run({"tags", "--json", "qqqqqq"}).out, "[]\n");
}

TEST(Tags, GivesJson) {
  EXPECT_EQ(run({"tags", "--json", "white"}).out,
            "[\n{\"tag\":\"WBAL\",\"label\":\"White balance\",\"reads\":\"4 floats\","
            "\"writes\":\"f 16\",\"accepts\":\"array of 4\"}\n]\n");
  EXPECT_EQ(
      run({"tags", "--ndjson", "GHTL"}).out,
      "{\"tag\":\"GHTL\",\"label\":null,\"reads\":null,\"writes\":\"H 4\",\"accepts\":null}\n");
  const Json all = Json::parse(run({"tags", "--json"}).out);
  EXPECT_EQ(all.size(), tagRows().size());
}

TEST(Tags, TakesOneText) { EXPECT_EQ(run({"tags", "white", "balance"}).exitCode, 2); }

}  // namespace
}  // namespace oxmv::cli::test
