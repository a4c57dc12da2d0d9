// The documents say what the command does: every example in them is run.

#include <cstdio>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <sstream>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "tests/support/TempDir.h"

namespace {

std::string contentOf(const std::string& path) {
  std::ifstream file(std::string(OXMV_SOURCE_DIR) + '/' + path, std::ios::binary);
  EXPECT_TRUE(file) << path;
  return {std::istreambuf_iterator<char>(file), {}};
}

// The texts between "```KIND" and "```".
std::vector<std::string> blocksOf(const std::string& document, const std::string& kind) {
  std::vector<std::string> blocks;
  const std::string opening = "```" + kind + "\n";
  for (std::size_t at = document.find(opening); at != std::string::npos;
       at = document.find(opening, at)) {
    at += opening.size();
    const std::size_t end = document.find("```\n", at);
    blocks.push_back(document.substr(at, end - at));
    at = end;
  }
  return blocks;
}

struct Example {
  std::string command;
  std::string output;
};

// In a block of commands each begins with "$ ", and what it prints follows.
std::vector<Example> examplesIn(const std::string& block) {
  std::vector<Example> examples;
  std::istringstream lines(block);
  for (std::string line; std::getline(lines, line);) {
    if (line.starts_with("$ ")) {
      examples.push_back({line.substr(2), ""});
    } else if (!examples.empty()) {
      examples.back().output += line + '\n';
    }
  }
  return examples;
}

// What a shell in the source folder prints, to either stream, with our command first in its path
// and the look tables in a folder of their own.
std::string outputOf(const std::string& command, const std::string& looks) {
  const std::string folder = std::filesystem::path(OXMV_COMMAND).parent_path().string();
  const oxmv::test::TempDir temporary;  // what an example makes there goes with it
  // The preferences of whoever runs the tests are none of the documents' business.
  const std::string line = "export HOME=/dev/null/nowhere TMPDIR='" + temporary.path().string() +
                           "'; unset XDG_CONFIG_HOME XDG_CONFIG_DIRS OXMV_DB; "
                           "cd '" OXMV_SOURCE_DIR "' && export OXMV_LOOKS='" +
                           looks + "' && PATH='" + folder + "':$PATH && { " + command + "; } 2>&1";
  std::FILE* pipe = ::popen(line.c_str(), "r");
  std::string output;
  for (int c = std::fgetc(pipe); c != EOF; c = std::fgetc(pipe)) output += static_cast<char>(c);
  ::pclose(pipe);
  return output;
}

TEST(Documents, ReadmeShowsWhatTheCommandPrints) {
  const oxmv::test::TempDir looks;
  std::size_t count = 0;
  for (const std::string& block : blocksOf(contentOf("README.md"), "console")) {
    for (const Example& example : examplesIn(block)) {
      EXPECT_EQ(outputOf(example.command, looks.path().string()), example.output)
          << example.command;
      ++count;
    }
  }
  EXPECT_GE(count, 6u);
}

TEST(Documents, FormatShowsTheBytesOfTheExample) {
  const std::string stream = contentOf("examples/walk.colr");
  const auto blocks = blocksOf(contentOf("docs/format.md"), "hex");
  ASSERT_EQ(blocks.size(), 1u);
  std::string shown;
  std::istringstream lines(blocks[0]);
  for (std::string line; std::getline(lines, line);) {
    std::istringstream digits(line.substr(10, 3 * 16));  // "00000000: " stands before
    for (std::string byte; digits >> byte;)
      shown += static_cast<char>(std::stoi(byte, nullptr, 16));
  }
  EXPECT_EQ(shown, stream);
}

}  // namespace
