// The segments at the head of a JPEG file.

#pragma once

#include <cstdint>
#include <span>

namespace oxmv {

// The content of the first APP1 segment that is EXIF, exifMark included; empty if there is none
// before the first scan. Other APP1 segments may stand before it.
std::span<const std::uint8_t> exifSegment(std::span<const std::uint8_t> jpeg);

}  // namespace oxmv
