#include <algorithm>
#include <string>

#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include "tests/cli/CommandRunner.h"
#include "tests/cli/LookFolder.h"

namespace oxmv::cli::test {
namespace {

using Json = nlohmann::json;

const std::string identity = lookData + "expected/Identity-2.xml/8FE30209.oxlook";
const std::string warm = lookData + "expected/Warm-17.xml/43B0C2CA.oxlook";

Json infoOf(const std::string& content, const std::string& name = "8FE30209.oxlook") {
  const LookFolder folder;
  writeFile(folder.look(name), content);
  return Json::parse(folder.run({"info", "--json", folder.look(name)}).out)[0];
}

TEST(LookInfo, ShowsHeaderAndValues) {
  const Outcome outcome = run({"look", "info", identity});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_EQ(outcome.err, "");
  EXPECT_EQ(outcome.out,
            "name      Identity-2\n"
            "version   2\n"
            "points    2 x 2 x 2\n"
            "header    64 bytes, constants 0x00015A01 and 0x0002160A\n"
            "file      160 bytes\n"
            "CRC       8FE30209, as the file is named\n"
            "first     0.0 to 1.0\n"
            "second    0.0 to 1.0\n"
            "third     0.0 to 1.0\n"
            "identity  yes, the first value changes fastest\n");
}

TEST(LookInfo, NamesTheFilesWhenThereAreSeveral) {
  const auto lines = linesOf(run({"look", "info", warm, identity}).out);
  EXPECT_EQ(lines.at(0), warm);
  EXPECT_EQ(lines.at(10), "identity  no");
  EXPECT_EQ(lines.at(11), "");
  EXPECT_EQ(lines.at(12), identity);
}

TEST(LookInfo, GivesTheMembersOfTheListAndMore) {
  EXPECT_EQ(run({"look", "info", "--ndjson", warm}).out,
            R"({"schema":"oxmv.look/1","file":")" + warm +
                R"(","crc":"43B0C2CA","version":2,"size":17,"name":"Warm-17",)"
                R"("byteOrder":"little","headerSize":64,"constantA":88577,"constantB":136714,)"
                R"("bytes":59020,"values":14739,"computedCrc":"43B0C2CA",)"
                R"("ranges":[[0.01,1.0],[0.0,1.01],[0.0,0.88]],"notFinite":0,"identity":false,)"
                R"("error":null})"
                "\n");
}

TEST(LookInfo, ReadsTheOtherByteOrder) {
  std::string file = readFile(identity);
  for (std::size_t i = 0; i < file.size(); i += 4) {
    if (i < 24 || i >= 64)
      std::reverse(file.begin() + static_cast<std::ptrdiff_t>(i),
                   file.begin() + static_cast<std::ptrdiff_t>(i + 4));
  }
  const Json info = infoOf(file);
  EXPECT_EQ(info["byteOrder"], "big");
  EXPECT_EQ(info["version"], 2);
  EXPECT_EQ(info["size"], 2);
  EXPECT_EQ(info["identity"], true);
  EXPECT_EQ(info["ranges"][2], (Json{0.0, 1.0}));
}

TEST(LookInfo, KnowsAnIdentityWhoseLastValueChangesFastest) {
  std::string file = readFile(identity);
  for (std::size_t i = 64; i < file.size(); i += 12)
    std::swap_ranges(file.begin() + static_cast<std::ptrdiff_t>(i),
                     file.begin() + static_cast<std::ptrdiff_t>(i + 4),
                     file.begin() + static_cast<std::ptrdiff_t>(i + 8));
  const LookFolder folder;
  writeFile(folder.look("0000000A.oxlook"), file);
  const auto lines = linesOf(folder.run({"info", folder.look("0000000A.oxlook")}).out);
  EXPECT_EQ(lines.back(), "identity  yes, the last value changes fastest");
  EXPECT_NE(lines.at(5).find(", and the file is named 0000000A"), std::string::npos);
  file[64] = 1;  // a value that is hardly more than 0
  EXPECT_EQ(infoOf(file)["identity"], true);
  file[67] = 0x3F;
  EXPECT_EQ(infoOf(file)["identity"], false);
}

TEST(LookInfo, CountsWhatIsNotFinite) {
  std::string file = readFile(identity);
  file.replace(64, 4, std::string("\0\0\xC0\x7F", 4));
  EXPECT_EQ(infoOf(file)["notFinite"], 1);
  EXPECT_EQ(infoOf(file)["identity"], false);
  for (std::size_t i = 64; i < file.size(); i += 12)
    file.replace(i, 4, std::string("\0\0\x80\x7F", 4));
  EXPECT_EQ(infoOf(file)["ranges"][0], nullptr);
}

TEST(LookInfo, TakesFilesOfEveryLength) {
  const std::string whole = readFile(identity);
  const LookFolder folder;
  for (std::size_t size = 0; size <= whole.size(); size += 5) {
    writeFile(folder.look("8FE30209.oxlook"), whole.substr(0, size));
    const Outcome outcome = folder.run({"info", "--json", folder.look("8FE30209.oxlook")});
    EXPECT_EQ(outcome.exitCode, size < 64 ? 3 : 0) << size;
    const Json info = Json::parse(outcome.out)[0];
    EXPECT_EQ(info.value("values", 0u), size < 64 ? 0 : (size - 64) / 12 * 3) << size;
  }
}

TEST(LookInfo, OfAnImpossibleSizeHasNoValues) {
  std::string file = readFile(identity);
  for (const char size : {'\0', '\x41', '\xFF'}) {
    file[12] = size;
    const Json info = infoOf(file);
    EXPECT_EQ(info["size"], static_cast<unsigned char>(size));
    EXPECT_FALSE(info.contains("ranges"));
  }
}

TEST(LookInfo, NamesWhatIsNoLookTableFile) {
  const LookFolder folder;
  const std::string file = folder.description("a.txt", "no look");
  const Outcome outcome = run({"look", "info", file});
  EXPECT_EQ(outcome.exitCode, 3);
  EXPECT_EQ(outcome.err, "oxmv: error: " + file +
                             ": is no look-table file: it does not begin with a header of 64 bytes"
                             " (not-a-look)\n");
}

}  // namespace
}  // namespace oxmv::cli::test
