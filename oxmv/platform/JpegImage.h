// Whether bytes are a JPEG image. Stands before the library that knows.

#pragma once

#include <cstdint>
#include <span>

namespace oxmv {

// Whether the bytes begin as a JPEG image that can be decoded begins: whole headers up to the first
// scan, of a process and precision that is supported, for an image of 1 to 65500 pixels a side. The
// pixels are not decoded: a whole image would take a thousand times as long, and a few bytes can
// claim one that takes gigabytes.
bool isJpegImage(std::span<const std::uint8_t> bytes);

}  // namespace oxmv
