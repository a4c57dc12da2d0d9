#include "oxmv/import/JpegSegments.h"

#include <algorithm>
#include <cstddef>
#include <optional>

#include "oxmv/platform/Exif.h"

namespace oxmv {
namespace {

using Bytes = std::span<const std::uint8_t>;

// file    := FF SOI  segment*
// segment := FF+ marker  size:u16be  content[size - 2]    -- the size counts itself
//          | FF+ marker                                   -- the markers that stand alone
enum Marker : std::uint8_t {
  stuffing = 0x00,  // no marker: a byte FF of something else
  temporary = 0x01,
  firstRestart = 0xD0,
  startOfImage = 0xD8,  // behind the eight restarts
  endOfImage = 0xD9,
  startOfScan = 0xDA,
  app1 = 0xE1,
  fill = 0xFF,
};

bool standsAlone(std::uint8_t marker) {
  return marker == temporary || (marker >= firstRestart && marker <= startOfImage);
}

// Goes behind the next marker and answers it. What stands before it is stepped over, as decoders
// do.
std::optional<std::uint8_t> takeMarker(Bytes& rest) {
  bool isMarker = false;
  for (std::size_t i = 0; i < rest.size(); ++i) {
    const std::uint8_t byte = rest[i];
    if (isMarker && byte != fill && byte != stuffing) {
      rest = rest.subspan(i + 1);
      return byte;
    }
    isMarker = byte == fill;
  }
  return std::nullopt;
}

// Goes behind the segment whose marker was taken, and answers its content.
std::optional<Bytes> takeContent(Bytes& rest) {
  if (rest.size() < 2) return std::nullopt;
  const std::size_t size = std::size_t{rest[0]} << 8 | rest[1];
  if (size < 2 || size > rest.size()) return std::nullopt;
  const Bytes content = rest.subspan(2, size - 2);
  rest = rest.subspan(size);
  return content;
}

bool isExif(Bytes content) {
  return content.size() >= exifMark.size() &&
         std::equal(exifMark.begin(), exifMark.end(), content.begin());
}

}  // namespace

Bytes exifSegment(Bytes jpeg) {
  Bytes rest = jpeg;
  while (const auto marker = takeMarker(rest)) {
    if (standsAlone(*marker)) continue;
    if (*marker == startOfScan || *marker == endOfImage) break;
    const auto content = takeContent(rest);
    if (!content) break;
    if (*marker == app1 && isExif(*content)) return *content;
  }
  return {};
}

}  // namespace oxmv
