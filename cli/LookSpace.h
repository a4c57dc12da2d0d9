// Look descriptions that an editor or a program has laid out in lines: every white space in a "LUT"
// element counts as a table, so they are imported without it.

#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <vector>

namespace oxmv::cli {

struct StrippedLook {
  // A part of the file that was left out.
  struct Cut {
    std::size_t offset;  // in the file
    std::size_t size;
    std::size_t before;  // bytes that were left out before it
  };

  std::vector<std::uint8_t> bytes;
  std::vector<Cut> cuts;  // in their order

  // Where in the file it came from a byte of `bytes` was.
  std::size_t offsetInFile(std::size_t offset) const;
};

// The description without the white space in its "LUT" elements: texts that are nothing else, and
// what stands at either end of a table or a size. Every other byte stays. Nothing when it is not
// well-formed or in UTF-16.
std::optional<StrippedLook> withoutSpace(std::span<const std::uint8_t> file);

}  // namespace oxmv::cli
