// What a camera says about a picture, in the form that EXIF gives it. Stands before the library
// that reads it.

#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <string>

namespace oxmv {

// What the content of a segment begins with if it is EXIF; an image file directory (as in a TIFF
// file) follows.
constexpr std::array<std::uint8_t, 6> exifMark = {'E', 'x', 'i', 'f', 0, 0};

// Each property is there if the picture has it, of the kind named here; of several the first
// counts. What is of another kind, cut off or broken is not there.
struct ExifProperties {
  // FocalLengthIn35mmFilm, in millimetres; one number of whatever type. Not a fraction over 0, but
  // perhaps 0, negative or not finite.
  std::optional<double> focalLength;
  // Software and Model: ASCII, up to the first NUL, nothing trimmed. May be empty: a text of one
  // NUL is a text. As all text it is UTF-8, or else taken as ISO-8859-1.
  std::optional<std::string> software;
  std::optional<std::string> model;
};

// Reads the content of an EXIF segment, exifMark included. Whatever the bytes are, the time it
// takes and the memory it needs stay in proportion to them.
ExifProperties readExif(std::span<const std::uint8_t> segment);

}  // namespace oxmv
