// The values of a look table, from the hexadecimal text in which a look description has them.
//
//   "0000803F0000003F ..."
//
// Each group of eight digits is one value: the dump of its four bytes, lowest address first, so
// that 0000803F is 1.0 and 0000003F is 0.5. Anything may stand between groups, nothing within one.

#pragma once

#include <cstddef>
#include <cstdint>
#include <span>
#include <string_view>

#include "oxmv/looks/Instructions.h"

namespace oxmv {

// What was read. Places are counted in UTF-16 code units from the start of the text, which are
// bytes if the text is ASCII.
struct HexTable {
  static constexpr std::size_t none = static_cast<std::size_t>(-1);

  std::size_t groups = 0;  // met, stored or not
  std::size_t stored = 0;  // values; fewer than groups when there was no room for all

  std::size_t malformed = 0;          // groups with something else among their eight characters, or
                                      // cut off by the end of the text
  std::size_t firstMalformed = none;  // where the first of them begins
  std::size_t firstSurplus = none;    // where the first group begins that had no room
  std::size_t leading = 0;            // characters before the first digit; all, if there is none
  bool isAscii = true;
};

// The most characters before the first digit with which a text is in order.
constexpr std::size_t maxLeading = 3;

// Reads the groups of `utf8`, which must be valid, into `values`, four bytes each, as many as have
// room. A malformed group is the value 0. As many characters at the end as stand before the first
// digit are ignored, as far as no group begins there, so the text may be enclosed in quotation
// marks. Behind the last value stored nothing is written if the text is ASCII; if it is not, there
// may be zeros in place of what was there.
HexTable readHexTable(std::string_view utf8, std::span<std::uint8_t> values,
                      Instructions instructions = bestInstructions());

}  // namespace oxmv
