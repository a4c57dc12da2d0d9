// Values as people read them, in a line.

#pragma once

#include <cstddef>
#include <cstdint>
#include <span>
#include <string>
#include <string_view>

#include "oxmv/values/Value.h"

namespace oxmv::cli {

// How much of a long value is shown.
enum class Extent : std::uint8_t { abbreviated, whole };

// Elements of a list that are shown when it is abbreviated.
constexpr std::size_t shownElements = 16;

// Numbers as tag JSON has them; a text as it is, in quotes where its ends would not be seen, and
// the NULs at its end counted: exterior (+4 NUL); data as hexadecimal digits; a list of numbers
// with blanks between them. Other lists, and dictionaries, by their sizes. All of it visible text.
std::string inLine(const Value& value, Extent extent);

// A value that stands alone: a number or text bare, a list of numbers with blanks between them,
// everything else as tag JSON. Nothing gives nothing. All of it visible text.
std::string bare(const Value& value);

// A name or text, the NULs at its end counted.
std::string textInLine(std::string_view text, Extent extent);

// "4 tags", "1 tag".
std::string counted(std::size_t count, std::string_view thing);

}  // namespace oxmv::cli
