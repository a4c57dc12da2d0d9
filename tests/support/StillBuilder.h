// Builds camera stills: real JPEG images with EXIF, and texts where the maker's cameras put them.

#pragma once

#include <cstdint>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "tests/support/StreamBuilder.h"

namespace oxmv::test {

enum class ByteOrder { little, big };

// The content of an EXIF segment: two directories of entries. Shares no code with the library.
class ExifBuilder {
 public:
  enum Type : std::uint16_t {
    byteType = 1,
    asciiType = 2,
    shortType = 3,
    longType = 4,
    rationalType = 5,
    undefinedType = 7,
    signedShortType = 8,
    signedLongType = 9,
    signedRationalType = 10,
    floatType = 11,
    doubleType = 12,
  };
  enum Tag : std::uint16_t { makeTag = 0x010F, modelTag = 0x0110, softwareTag = 0x0131 };
  static constexpr std::uint16_t focalLengthTag = 0xA405;

  explicit ExifBuilder(ByteOrder order = ByteOrder::little) : order_(order) {}

  // Texts with their NUL, and a number of 16 bits: what cameras write.
  ExifBuilder& make(std::string_view text) { return text_(makeTag, text); }
  ExifBuilder& model(std::string_view text) { return text_(modelTag, text); }
  ExifBuilder& software(std::string_view text) { return text_(softwareTag, text); }
  ExifBuilder& focalLength(std::uint16_t millimetres);

  // Any entry of the image's directory, and of the one for EXIF alone. `words` are written in the
  // byte order, each in `width` bytes.
  ExifBuilder& entry(std::uint16_t tag, std::uint16_t type, std::uint32_t count, Bytes value);
  ExifBuilder& exifEntry(std::uint16_t tag, std::uint16_t type, std::uint32_t count, Bytes value);
  Bytes words(const std::vector<std::uint32_t>& words, std::size_t width) const;

  // What careless writers do: no offset of a next directory stands behind the entries, of either
  // directory; each says to have so many entries more than it has.
  ExifBuilder& withoutLinks() { return hasLinks_ = false, *this; }
  ExifBuilder& withSurplusCount(std::uint16_t surplus) { return surplus_ = surplus, *this; }

  Bytes bytes() const;

 private:
  struct Entry {
    std::uint16_t tag;
    std::uint16_t type;
    std::uint32_t count;
    Bytes value;
  };

  ExifBuilder& text_(std::uint16_t tag, std::string_view text);
  Bytes directory(std::vector<Entry> entries, std::size_t offset) const;

  ByteOrder order_;
  bool hasLinks_ = true;
  std::uint16_t surplus_ = 0;
  std::vector<Entry> image_;
  std::vector<Entry> exif_;
};

// A segment in which each of three directories names the next one so many times: taken one by one,
// count to the power of three ways down.
Bytes exifThatNamesDirectories(std::uint32_t count, ByteOrder order);

// A whole file: segments, a comment that holds the two texts, and a picture of 64 x 48 grey pixels.
class StillBuilder {
 public:
  // The texts at bytes 1038 and 1062 of the file, ended by a NUL. Without: only zeros stand there.
  StillBuilder& maker(std::string_view text);
  StillBuilder& modelText(std::string_view text);

  StillBuilder& exif(const ExifBuilder& exif) { return segment(0xE1, exif.bytes()); }
  // Segments go before the comment if they all fit there, else behind it.
  StillBuilder& segment(std::uint8_t marker, const Bytes& content);

  Bytes bytes() const;

 private:
  Bytes segments_;
  std::string maker_;
  std::string modelText_;
};

// The picture alone, and with a size that is not its own.
Bytes picture();
Bytes pictureThatClaims(std::uint16_t width, std::uint16_t height);

// The still in examples/.
Bytes exampleStill();

// Stills to begin with when looking for hostile ones, and what is odd about each.
std::vector<std::pair<std::string, Bytes>> namedStills();

}  // namespace oxmv::test
