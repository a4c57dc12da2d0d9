#include "oxmv/platform/ExifDirectories.h"

#include <algorithm>
#include <cstddef>
#include <utility>

#include "oxmv/platform/Exif.h"

namespace oxmv {
namespace {

using Bytes = std::span<std::uint8_t>;

// file      := ("II" | "MM")  42:u16  first directory's offset:u32 ...    -- offsets count from here
// directory := count:u16  entry[count]  next directory's offset:u32
// entry     := tag:u16  type:u16  count:u32  value or its offset:u32
constexpr std::size_t headerSize = 8;
constexpr std::size_t entrySize = 12;
constexpr std::uint8_t unknownTagByte = 0xFF;  // of a tag, both

// The bytes behind the mark, in their own order. Offsets must be inside.
class Words {
 public:
  explicit Words(Bytes bytes) : bytes_(bytes), isLittle_(bytes[0] == 'I') {}

  std::size_t size() const { return bytes_.size(); }
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
  // Answers whether that changed anything.
  bool fill(std::size_t at, std::size_t count, std::uint8_t byte) {
    const Bytes bytes = bytes_.subspan(at, count);
    const bool isChange =
        std::any_of(bytes.begin(), bytes.end(), [&](std::uint8_t old) { return old != byte; });
    std::fill(bytes.begin(), bytes.end(), byte);
    return isChange;
  }

 private:
  Bytes bytes_;
  bool isLittle_;
};

// Takes entries out of one directory and cuts it off from the next one.
class Directory {
 public:
  Directory(Words& words, std::size_t offset) : words_(words) {
    if (words.size() < 2 || offset > words.size() - 2) return;
    count_ = words.word16(offset);
    first_ = offset + 2;
  }

  // Every entry but those that `isKept` knows by tag and value. Answers whether that changed
  // anything.
  template <class IsKept>
  bool reduce(IsKept isKept) {
    if (first_ == 0) return false;
    const std::size_t rest = words_.size() - first_;
    bool isChange = false;
    for (std::size_t i = 0; i < std::min(count_, rest / entrySize); ++i) {
      const std::size_t entry = first_ + i * entrySize;
      if (!isKept(ExifTagNumber{words_.word16(entry)}, words_.word32(entry + 8)))
        isChange |= words_.fill(entry, 2, unknownTagByte);
    }
    if (rest >= 4 && count_ <= (rest - 4) / entrySize)
      isChange |= words_.fill(first_ + count_ * entrySize, 4, 0);
    return isChange;
  }

 private:
  Words& words_;
  std::size_t first_ = 0;  // entry; 0: there is no directory
  std::size_t count_ = 0;  // of entries, as it says
};

// Of several entries with the same tag the first one stays, as readers have it.
bool reduce(Words words) {
  const std::size_t first = words.word32(4);
  std::optional<std::size_t> second;
  bool hasModel = false;
  bool hasSoftware = false;
  bool isChange = Directory(words, first).reduce([&](ExifTagNumber tag, std::uint32_t value) {
    if (tag == ExifTagNumber::model) return !std::exchange(hasModel, true);
    if (tag == ExifTagNumber::software) return !std::exchange(hasSoftware, true);
    if (tag != ExifTagNumber::exifDirectory || second || value == first) return false;
    second = value;
    return true;
  });
  if (!second) return isChange;
  bool hasFocalLength = false;
  isChange |= Directory(words, *second).reduce([&](ExifTagNumber tag, std::uint32_t) {
    return tag == ExifTagNumber::focalLength && !std::exchange(hasFocalLength, true);
  });
  return isChange;
}

}  // namespace

std::optional<std::vector<std::uint8_t>> reducedExif(std::span<const std::uint8_t> segment) {
  if (segment.size() < exifMark.size() + headerSize) return std::nullopt;
  std::vector<std::uint8_t> copy(segment.begin(), segment.end());
  const Bytes bytes = Bytes(copy).subspan(exifMark.size());
  if (bytes[0] != bytes[1] || (bytes[0] != 'I' && bytes[0] != 'M')) return std::nullopt;
  // What is written into one of two directories that overlap also changes the other. If that made
  // anything of it that would have to go as well, the copy is not to be trusted.
  reduce(Words(bytes));
  if (reduce(Words(bytes))) return std::nullopt;
  return copy;
}

}  // namespace oxmv
