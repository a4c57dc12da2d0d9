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

// A copy of the segment in which all other entries have a tag that no reader knows, and no further
// directory can be reached. A reader that goes into each directory wherever it is named takes hours
// for some kilobytes in which directories name each other thousands of times, and hundreds of
// megabytes for some in which the entries of a maker's note share their bytes; none of that is there
// any more.
//
// Nothing if the bytes are no such segment, or the two directories overlap so that no copy is both
// whole and harmless.
std::optional<std::vector<std::uint8_t>> reducedExif(std::span<const std::uint8_t> segment);

}  // namespace oxmv
