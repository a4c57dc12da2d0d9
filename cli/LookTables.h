// Look-table files as the command looks into them.

#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <string_view>

#include "cli/Inputs.h"
#include "oxmv/looks/LookTableFile.h"

namespace oxmv::cli {

// Whether the points of a table are the places that they have in it.
enum class Identity : std::uint8_t {
  no,
  firstFastest,  // and the first value changes from point to point
  lastFastest,   // the last one does
};

// What there is to know of a table's values.
struct TableValues {
  struct Range {
    float least, most;
  };

  std::uint32_t crc = 0;  // of all bytes of the table
  // Of the first, second and third value of the points; nothing when none of them is finite.
  std::array<std::optional<Range>, 3> ranges;
  std::size_t notFinite = 0;
  std::size_t firstNotFinite = 0;  // counted from 0
  Identity identity = Identity::no;
};

// `header` is that of the file, and `table` has whole points, as many as it asks for or fewer.
TableValues valuesOf(const OXLOOK_HEADER& header, std::span<const std::uint8_t> table);

// The table of a file whose size is 1 to 64, as far as it is there, in whole points.
std::span<const std::uint8_t> tableOf(const OXLOOK_HEADER& header, const Bytes& file);

bool isOtherByteOrder(const OXLOOK_HEADER& header) noexcept;
bool hasUsableSize(const OXLOOK_HEADER& header) noexcept;

// A table of which a description gave the first values only is named by the CRC of those: how many
// they are, if all behind them is zero. Nothing when no number of values has this CRC.
std::optional<std::size_t> valuesWithCrc(std::span<const std::uint8_t> table, std::uint32_t crc);

}  // namespace oxmv::cli
