// Runs the command as a process, as its users do.

#pragma once

#include <filesystem>
#include <string>
#include <string_view>
#include <vector>

#include "tests/support/StreamBuilder.h"

namespace oxmv::cli::test {

struct Outcome {
  int exitCode;     // 128 and more: ended by that signal
  std::string out;  // standard output; on a terminal, everything
  std::string err;
};

// The command with these arguments. `input` is what standard input holds. Neither output is a
// terminal, and the environment says nothing of colours, folders or preferences.
Outcome run(const std::vector<std::string>& arguments, std::string_view input = {});

// The same with these variables in the environment: "NAME=VALUE".
Outcome runWith(const std::vector<std::string>& environment,
                const std::vector<std::string>& arguments, std::string_view input = {});

// A shell script, in which "$OXMV" is the command.
Outcome runShell(const std::string& script);

// The command with a terminal for standard input, output and error. Line ends are "\n".
Outcome runOnTerminal(const std::vector<std::string>& arguments,
                      const std::vector<std::string>& environment = {});

void writeFile(const std::filesystem::path& path, std::string_view content);
void writeFile(const std::filesystem::path& path, const oxmv::test::Bytes& content);
std::string readFile(const std::filesystem::path& path);

std::vector<std::string> linesOf(const std::string& text);

}  // namespace oxmv::cli::test
