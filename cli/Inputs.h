// The files that a call works on.

#pragma once

#include <cstdint>
#include <string>
#include <string_view>
#include <variant>
#include <vector>

#include "cli/Verb.h"

namespace oxmv::cli {

using Bytes = std::vector<std::uint8_t>;

// Why a file could not be read or written.
struct FileProblem {
  std::string_view code;  // stable: "missing"
  std::string message;
};

FileProblem problemOf(const std::error_code& error);

// A whole file; `name` is a path, or "-" for standard input.
std::variant<Bytes, FileProblem> readInput(const std::string& name);

// The files that the words name, and behind them those that --files-from names. A list that cannot
// be read is reported, and the others are answered. Throws UsageError when neither names anything,
// and when standard input is named twice.
std::vector<std::string> namedInputs(Call& call);

// The bytes as text, whatever they are.
std::string_view asText(const Bytes& bytes);

}  // namespace oxmv::cli
