#include "oxmv/platform/ExifDirectories.h"

#include <array>
#include <cstddef>
#include <utility>

#include "oxmv/platform/Exif.h"

namespace oxmv {
namespace {

using Bytes = std::span<const std::uint8_t>;

// file      := ("II" | "MM")  42:u16  first directory's offset:u32 ...    -- offsets count from here
// directory := count:u16  entry[count]  next directory's offset:u32
// entry     := tag:u16  type:u16  count:u32  value, or its offset:u32 if it has more than 4 bytes
constexpr std::size_t headerSize = 8;
constexpr std::size_t entrySize = 12;
constexpr std::size_t entryHeadSize = 8;
constexpr std::size_t directorySize(std::size_t entries) { return 2 + entries * entrySize + 4; }

// Of one value, by its type: BYTE, ASCII, SHORT, LONG, RATIONAL, and so on (TIFF 6.0, section 2).
constexpr auto typeSizes = std::to_array<std::size_t>({0, 1, 1, 2, 4, 8, 1, 1, 2, 4, 8, 4, 8});

struct Entry {
  Bytes head;   // tag, type and count
  Bytes value;  // not empty
};

// The directories behind the mark. Reads within the bytes only; there must be a header.
class Directories {
 public:
  explicit Directories(Bytes bytes) : bytes_(bytes), isLittle_(bytes[0] == 'I') {}

  bool isLittle() const { return isLittle_; }
  std::size_t first() const { return word32(4); }

  // Of several the first one with a value that is there.
  std::optional<Entry> find(std::size_t directory, ExifTagNumber tag) const {
    std::optional<Entry> found;
    findAt(directory, tag, [&](std::size_t at) {
      const Bytes value = valueAt(at);
      if (!value.empty()) found = Entry{bytes_.subspan(at, entryHeadSize), value};
      return found.has_value();
    });
    return found;
  }

  // What an entry names, of whatever type it says to be. Of several the first one that is there.
  std::optional<std::size_t> findDirectory(std::size_t directory, ExifTagNumber tag) const {
    std::optional<std::size_t> found;
    findAt(directory, tag, [&](std::size_t at) {
      const std::size_t offset = word32(at + entryHeadSize);
      if (isInside(offset, 2)) found = offset;
      return found.has_value();
    });
    return found;
  }

 private:
  std::uint16_t word16(std::size_t at) const {
    const std::size_t low = isLittle_ ? at : at + 1;
    const std::size_t high = isLittle_ ? at + 1 : at;
    return static_cast<std::uint16_t>(bytes_[high] << 8 | bytes_[low]);
  }
  std::uint32_t word32(std::size_t at) const {
    const std::uint32_t low = word16(isLittle_ ? at : at + 2);
    const std::uint32_t high = word16(isLittle_ ? at + 2 : at);
    return high << 16 | low;
  }
  bool isInside(std::size_t offset, std::uint64_t size) const {
    return offset <= bytes_.size() && size <= bytes_.size() - offset;
  }

  // Offers the entries with that tag until one is taken. A directory may claim more than there are.
  template <class Take>
  void findAt(std::size_t directory, ExifTagNumber tag, Take take) const {
    if (!isInside(directory, 2)) return;
    std::size_t at = directory + 2;
    for (std::size_t left = word16(directory); left > 0 && isInside(at, entrySize); --left) {
      if (ExifTagNumber{word16(at)} == tag && take(at)) return;
      at += entrySize;
    }
  }

  // Empty if some of it is not there.
  Bytes valueAt(std::size_t entry) const {
    const std::size_t type = word16(entry + 2);
    if (type >= typeSizes.size()) return {};
    const std::uint64_t size = std::uint64_t{typeSizes[type]} * word32(entry + 4);
    const std::size_t place = entry + entryHeadSize;
    const std::size_t offset = size <= 4 ? place : word32(place);
    if (!isInside(offset, size)) return {};
    return bytes_.subspan(offset, static_cast<std::size_t>(size));
  }

  Bytes bytes_;
  bool isLittle_;
};

// Behind its directory; an offset is even.
std::size_t roomFor(Bytes value) { return value.size() <= 4 ? 0 : (value.size() + 1) / 2 * 2; }

// Writes directories one after the other, each with the values behind it that it has no room for.
class SegmentWriter {
 public:
  // `head`: the bytes up to the offset of the first directory, which will follow.
  SegmentWriter(Bytes head, bool isLittle) : isLittle_(isLittle) {
    bytes(head);
    word32(headerSize);
  }

  void beginDirectory(std::size_t entries) {
    valuesOffset_ = bytes_.size() - exifMark.size() + directorySize(entries);
    word16(entries);
  }
  void entry(const Entry& entry) {
    bytes(entry.head);
    if (entry.value.size() <= 4) {
      bytes(entry.value);
      bytes_.resize(bytes_.size() + 4 - entry.value.size());
    } else {
      word32(valuesOffset_ + values_.size());
      values_.insert(values_.end(), entry.value.begin(), entry.value.end());
      values_.resize(values_.size() + roomFor(entry.value) - entry.value.size());
    }
  }
  void entry(ExifTagNumber tag, std::size_t directoryOffset) {
    constexpr std::size_t typeLong = 4;
    word16(static_cast<std::size_t>(tag));
    word16(typeLong);
    word32(1);
    word32(directoryOffset);
  }
  void endDirectory() {
    word32(0);  // no further one
    bytes(values_);
    values_.clear();
  }

  std::vector<std::uint8_t> finish() { return std::move(bytes_); }

 private:
  void bytes(Bytes bytes) { bytes_.insert(bytes_.end(), bytes.begin(), bytes.end()); }
  void word16(std::size_t word) { put(word, 2); }
  void word32(std::size_t word) { put(word, 4); }
  void put(std::size_t word, std::size_t width) {
    for (std::size_t i = 0; i < width; ++i)
      bytes_.push_back(static_cast<std::uint8_t>(word >> 8 * (isLittle_ ? i : width - 1 - i)));
  }

  bool isLittle_;
  std::size_t valuesOffset_ = 0;  // of the directory that has begun
  std::vector<std::uint8_t> bytes_;
  std::vector<std::uint8_t> values_;
};

}  // namespace

std::optional<std::vector<std::uint8_t>> reducedExif(std::span<const std::uint8_t> segment) {
  if (segment.size() < exifMark.size() + headerSize) return std::nullopt;
  const Bytes bytes = segment.subspan(exifMark.size());
  if (bytes[0] != bytes[1] || (bytes[0] != 'I' && bytes[0] != 'M')) return std::nullopt;

  const Directories directories(bytes);
  std::vector<Entry> image;
  for (const auto tag : {ExifTagNumber::model, ExifTagNumber::software}) {
    if (const auto entry = directories.find(directories.first(), tag)) image.push_back(*entry);
  }
  std::optional<Entry> focalLength;
  if (const auto exif =
          directories.findDirectory(directories.first(), ExifTagNumber::exifDirectory))
    focalLength = directories.find(*exif, ExifTagNumber::focalLength);

  const std::size_t imageEntries = image.size() + (focalLength ? 1 : 0);
  std::size_t exifOffset = headerSize + directorySize(imageEntries);
  for (const Entry& entry : image) exifOffset += roomFor(entry.value);

  // Whoever reads it judges the number 42.
  SegmentWriter writer(segment.first(exifMark.size() + 4), directories.isLittle());
  writer.beginDirectory(imageEntries);
  for (const Entry& entry : image) writer.entry(entry);
  if (focalLength) writer.entry(ExifTagNumber::exifDirectory, exifOffset);
  writer.endDirectory();
  if (focalLength) {
    writer.beginDirectory(1);
    writer.entry(*focalLength);
    writer.endDirectory();
  }
  return writer.finish();
}

}  // namespace oxmv
