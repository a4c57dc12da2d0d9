// Configuration in TOML, as values. Stands before the library that reads it.

#pragma once

#include <cstddef>
#include <string>
#include <string_view>
#include <variant>

#include "oxmv/values/Dictionary.h"

namespace oxmv {

// Why a text is not read, and where: at that character of that line, both counted from 1; both 0 if
// it is about the whole text.
struct TomlProblem {
  std::string message;
  std::size_t line;
  std::size_t column;
};

// The larger text is refused before anything looks at it: tables that people write are far smaller.
constexpr std::size_t maxTomlSize = std::size_t{64} << 10;
// Points and opening brackets in a text. Every level of nesting needs one of them, so this also
// limits the depth, and with it the stack that the recursion takes: 300 KiB for the worst of texts.
constexpr std::size_t maxTomlOpenings = 256;

// A document: its tables as dictionaries, with their keys in alphabetical order. Booleans, dates and
// times have no place in a dictionary, and are refused like what is no TOML. So is, even in comments,
// what is not ASCII (texts may have it as \u00E9): the reader behind does not withstand all of it.
std::variant<Dictionary, TomlProblem> readToml(std::string_view text);

}  // namespace oxmv
