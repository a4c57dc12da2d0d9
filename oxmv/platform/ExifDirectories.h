// The part of an EXIF segment that is worth reading.

#pragma once

#include <cstdint>
#include <optional>
#include <span>
#include <vector>

namespace oxmv {

// The tags that are read: the first two of the image's directory, the last of that for EXIF alone.
enum class ExifTagNumber : std::uint16_t {
  model = 0x0110,
  software = 0x0131,
  exifDirectory = 0x8769,
  focalLength = 0xA405,  // FocalLengthIn35mmFilm
};

// A small segment in the same byte order with nothing but these entries, their values copied, and
// no further directory. A reader that goes into each directory wherever it is named takes hours for
// some kilobytes in which directories name each other thousands of times, and hundreds of megabytes
// for some in which the entries of a maker's note share their bytes; none of that is there any
// more.
//
// An entry of which some is not there is left out, or if its type is unknown; of several with the
// same tag the first one of the others stays. Where a directory claims more entries than there are,
// those that are there count, and it needs no offset of a next one behind them.
//
// Nothing if the bytes are no such segment.
std::optional<std::vector<std::uint8_t>> reducedExif(std::span<const std::uint8_t> segment);

}  // namespace oxmv
