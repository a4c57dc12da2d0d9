#include <string>
#include <vector>

#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include "tests/cli/CommandRunner.h"
#include "tests/cli/LookFolder.h"

namespace oxmv::cli::test {
namespace {

using Json = nlohmann::json;

const std::string identity = lookData + "expected/Identity-2.xml/8FE30209.oxlook";

// "BYTE CODE" of each finding.
std::vector<std::string> findingsIn(const std::string& content,
                                    const std::string& name = "8FE30209.oxlook") {
  const LookFolder folder;
  writeFile(folder.look(name), content);
  const Outcome outcome = folder.run({"check", "--json", folder.look(name)});
  std::vector<std::string> findings;
  const Json results = Json::parse(outcome.out);
  for (const Json& finding : results[0]["findings"])
    findings.push_back(finding["offset"].dump() + ' ' + finding["code"].get<std::string>());
  EXPECT_EQ(outcome.exitCode, findings.empty() ? 0 : 1);
  return findings;
}

std::string with(std::size_t offset, const std::string& bytes) {
  return readFile(identity).replace(offset, bytes.size(), bytes);
}

using Findings = std::vector<std::string>;

TEST(LookCheck, SaysNothingWhenAllIsWell) {
  const Outcome outcome =
      run({"look", "check", identity, lookData + "expected/Night-33.xml/122C1A66.oxlook"});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_EQ(outcome.out + outcome.err, "");
}

TEST(LookCheck, NamesFileByteAndCode) {
  const LookFolder folder;
  writeFile(folder.look("8FE30209.oxlook"), with(4, std::string(1, '\1')));
  EXPECT_EQ(folder.run({"check", folder.look("8FE30209.oxlook")}).out,
            folder.look("8FE30209.oxlook") +
                ": byte 4: version 1: hosts show the file's name, and an import replaces the file"
                " (old-version)\n");
}

TEST(LookCheck, FindsWhatIsWrongWithTheHeader) {
  EXPECT_EQ(findingsIn(with(0, "OXLX")), (Findings{"0 bad-magic"}));
  EXPECT_EQ(findingsIn(with(4, "\3")), (Findings{"4 new-version"}));
  EXPECT_EQ(findingsIn(with(8, "\x41")), (Findings{"8 header-size"}));
  EXPECT_EQ(findingsIn(with(12, std::string(1, '\0'))), (Findings{"12 bad-size"}));
  EXPECT_EQ(findingsIn(with(12, "\x41")), (Findings{"12 bad-size"}));
  EXPECT_EQ(findingsIn(with(16, "\2")), (Findings{"16 bad-constant"}));
  EXPECT_EQ(findingsIn(with(20, "\2")), (Findings{"20 bad-constant"}));
  EXPECT_EQ(findingsIn(with(24, std::string(40, '\0'))), (Findings{"24 no-name"}));
  EXPECT_EQ(findingsIn(with(24, std::string(40, 'n'))), (Findings{"24 name-without-end"}));
  EXPECT_EQ(findingsIn(with(24, "\xE9")), (Findings{"24 name-not-ascii"}));
}

TEST(LookCheck, FindsAWrongLength) {
  const std::string file = readFile(identity);
  EXPECT_EQ(findingsIn(file + 'x'), (Findings{"160 long-file"}));
  EXPECT_EQ(findingsIn(with(12, "\1")), (Findings{"76 long-file", "64 crc-differs"}));
  for (std::size_t size = 0; size < file.size(); ++size)
    EXPECT_EQ(findingsIn(file.substr(0, size)), (Findings{std::to_string(size) + " short-file"}));
}

TEST(LookCheck, ComparesTheCrcWithTheName) {
  const std::string file = readFile(identity);
  EXPECT_EQ(findingsIn(file, "8FE3020A.oxlook"), (Findings{"64 crc-differs"}));
  EXPECT_EQ(findingsIn(with(76, "\1")), (Findings{"64 crc-differs"}));
  EXPECT_EQ(findingsIn(file, "look.oxlook"), (Findings{"null bad-name"}));
  EXPECT_EQ(findingsIn(file, "8fe30209.oxlook"), (Findings{"null odd-name"}));
  EXPECT_EQ(findingsIn(file, "8FE30209.copy"), (Findings{"null odd-name"}));
  // Standard input has no name.
  EXPECT_EQ(run({"look", "check", "-"}, file).exitCode, 0);
}

TEST(LookCheck, KnowsTablesWhoseDescriptionHadTooFewValues) {
  const std::string few = lookData + "expected/too-few-values.xml/EE85C9DB.oxlook";
  EXPECT_EQ(run({"look", "check", few}).out,
            few +
                ": byte 72: the description gave 2 values of 24, and those behind are 0"
                " (values-missing)\n");
  const std::string none = lookData + "expected/white-space-after-size.xml/00000000.oxlook";
  EXPECT_EQ(run({"look", "check", none}).out,
            none +
                ": byte 64: the description gave 0 values of 3, and those behind are 0"
                " (values-missing)\n");
}

TEST(LookCheck, FindsValuesThatAreNotFinite) {
  EXPECT_EQ(findingsIn(with(68, std::string("\0\0\xC0\x7F\0\0\x80\xFF", 8))),
            (Findings{"64 crc-differs", "68 not-finite"}));
}

TEST(LookCheck, NamesAFileThatCannotBeRead) {
  const Outcome outcome = run({"look", "check", "--ndjson", "/nonexistent/0.oxlook", identity});
  EXPECT_EQ(outcome.exitCode, 3);
  EXPECT_EQ(outcome.out,
            R"({"schema":"oxmv.look.check/1","file":"/nonexistent/0.oxlook","findings":null,)"
            R"("error":{"code":"missing","message":"No such file or directory"}})"
            "\n"
            R"({"schema":"oxmv.look.check/1","file":")" +
                identity +
                R"(","findings":[],"error":null})"
                "\n");
}

}  // namespace
}  // namespace oxmv::cli::test
