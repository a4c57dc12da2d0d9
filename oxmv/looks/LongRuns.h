// The long runs of hexadecimal text in a look description, and the document without them.
//
// A table's text makes up nearly all of a description, and an XML parser needs more time for
// looking at its characters than everything else takes together. In character data one text is as
// good as another, as long as it has no markup in it: so each long run can be replaced by a single
// character before the parsing, and put back by its place.

#pragma once

#include <cstddef>
#include <cstdint>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "oxmv/looks/Instructions.h"

namespace oxmv {

// A shorter run is not worth replacing.
constexpr std::size_t minLongRun = 1024;

// One run: hexadecimal digits, blanks, tabulators, line ends, commas and quotation marks between a
// '>' and a '<'. So no line end is half of one: carriage return and line feed are both in it.
struct LongRun {
  std::size_t offset;     // in the document
  std::string_view text;  // a view into the document
};

struct Skeleton {
  std::string text;                 // the document, with one '0' for each run
  std::vector<LongRun> runs;        // in their order
  std::vector<std::size_t> places;  // where in `text` each run's '0' stands
};

// Finds the runs. Without any, the skeleton has no text.
Skeleton withoutLongRuns(std::string_view document, Instructions instructions = bestInstructions());

}  // namespace oxmv
