#include "tests/support/StillBuilder.h"

#include <algorithm>
#include <cstdlib>
#include <stdexcept>

namespace oxmv::test {
namespace {

using namespace std::string_view_literals;

constexpr std::size_t makerOffset = 1038;
constexpr std::size_t modelOffset = 1062;

void append(Bytes& bytes, const Bytes& more) {
  bytes.insert(bytes.end(), more.begin(), more.end());
}

void appendWord(Bytes& bytes, std::uint32_t word, std::size_t width, ByteOrder order) {
  for (std::size_t i = 0; i < width; ++i) {
    const std::size_t place = order == ByteOrder::little ? i : width - 1 - i;
    bytes.push_back(static_cast<std::uint8_t>(word >> 8 * place));
  }
}

Bytes segmentOf(std::uint8_t marker, const Bytes& content) {
  if (content.size() > 0xFFFD) throw std::invalid_argument("no segment is that large");
  Bytes bytes = {0xFF, marker};
  appendWord(bytes, static_cast<std::uint32_t>(content.size() + 2), 2, ByteOrder::big);
  append(bytes, content);
  return bytes;
}

// Bits, most significant first; a byte of ones gets a zero behind it, as scans have it.
class BitWriter {
 public:
  void write(std::uint32_t bits, int count) {
    for (int i = count - 1; i >= 0; --i) {
      byte_ = static_cast<std::uint8_t>(std::uint32_t{byte_} << 1 | (bits >> i & 1));
      if (++filled_ == 8) put();
    }
  }
  Bytes bytes() {
    while (filled_ != 0) write(1, 1);
    return bytes_;
  }

 private:
  void put() {
    bytes_.push_back(byte_);
    if (byte_ == 0xFF) bytes_.push_back(0);
    filled_ = 0;
  }
  Bytes bytes_;
  std::uint8_t byte_ = 0;
  int filled_ = 0;
};

// The scan of a picture in which every block of 8 x 8 pixels is of one grey: only the mean of each
// block is coded, as its difference from the one before.
Bytes scan(int columns, int rows) {
  BitWriter bits;
  int last = 0;
  for (int row = 0; row < rows; ++row) {
    for (int column = 0; column < columns; ++column) {
      const int mean = -120 + 240 * (row + column) / (rows + columns - 2);
      const int difference = mean - last;
      last = mean;
      int size = 0;
      while (std::abs(difference) >> size != 0) ++size;
      bits.write(static_cast<std::uint32_t>(size), 4);  // the code of each size is itself
      const int coded = difference < 0 ? difference + (1 << size) - 1 : difference;
      bits.write(static_cast<std::uint32_t>(coded), size);
      bits.write(0, 1);  // no details in this block
    }
  }
  return bits.bytes();
}

}  // namespace

ExifBuilder& ExifBuilder::text_(std::uint16_t tag, std::string_view text) {
  Bytes value = bytesOf(text);
  value.push_back(0);
  const auto count = static_cast<std::uint32_t>(value.size());
  return entry(tag, asciiType, count, std::move(value));
}

ExifBuilder& ExifBuilder::focalLength(std::uint16_t millimetres) {
  return exifEntry(focalLengthTag, shortType, 1, words({millimetres}, 2));
}

ExifBuilder& ExifBuilder::entry(std::uint16_t tag, std::uint16_t type, std::uint32_t count,
                                Bytes value) {
  image_.push_back({tag, type, count, std::move(value)});
  return *this;
}

ExifBuilder& ExifBuilder::exifEntry(std::uint16_t tag, std::uint16_t type, std::uint32_t count,
                                    Bytes value) {
  exif_.push_back({tag, type, count, std::move(value)});
  return *this;
}

Bytes ExifBuilder::words(const std::vector<std::uint32_t>& words, std::size_t width) const {
  Bytes bytes;
  for (const std::uint32_t word : words) appendWord(bytes, word, width, order_);
  return bytes;
}

// directory := count:u16  entry[count]  next:u32            -- then the values of more than 4 bytes
// entry     := tag:u16  type:u16  count:u32  value or its offset:u32
Bytes ExifBuilder::directory(std::vector<Entry> entries, std::size_t offset) const {
  std::stable_sort(entries.begin(), entries.end(),
                   [](const Entry& a, const Entry& b) { return a.tag < b.tag; });
  Bytes bytes = words({static_cast<std::uint32_t>(entries.size()) + surplus_}, 2);
  Bytes values;
  const std::size_t valuesOffset = offset + 2 + entries.size() * 12 + (hasLinks_ ? 4 : 0);
  for (const Entry& entry : entries) {
    append(bytes, words({entry.tag, entry.type}, 2));
    append(bytes, words({entry.count}, 4));
    if (entry.value.size() <= 4) {
      append(bytes, entry.value);
      bytes.resize(bytes.size() + 4 - entry.value.size());
    } else {
      append(bytes, words({static_cast<std::uint32_t>(valuesOffset + values.size())}, 4));
      append(values, entry.value);
      if (values.size() % 2 != 0) values.push_back(0);
    }
  }
  if (hasLinks_) append(bytes, words({0}, 4));
  append(bytes, values);
  return bytes;
}

Bytes ExifBuilder::bytes() const {
  Bytes bytes = {'E', 'x', 'i', 'f', 0, 0};
  append(bytes, bytesOf(order_ == ByteOrder::little ? "II" : "MM"));
  append(bytes, words({42}, 2));
  append(bytes, words({8}, 4));
  if (exif_.empty()) {
    append(bytes, directory(image_, 8));
    return bytes;
  }
  // The second directory stands behind the first one, whose size does not depend on where that is.
  std::vector<Entry> image = image_;
  image.push_back({0x8769, longType, 1, words({0}, 4)});
  const std::size_t offset = 8 + directory(image, 8).size();
  image.back().value = words({static_cast<std::uint32_t>(offset)}, 4);
  append(bytes, directory(image, 8));
  append(bytes, directory(exif_, offset));
  return bytes;
}

Bytes exifThatNamesDirectories(std::uint32_t count, ByteOrder order) {
  constexpr std::uint32_t header = 6 + 8;
  const std::uint32_t size = 2 + count * 12 + 4;
  Bytes bytes = ExifBuilder(order).bytes();
  bytes.resize(header);
  for (std::uint32_t level = 1; level <= 3; ++level) {
    ExifBuilder directory(order);
    for (std::uint32_t i = 0; i < count; ++i)
      directory.entry(level % 2 == 1 ? 0x8769 : 0x8825, ExifBuilder::longType, 1,
                      directory.words({8 + level * size}, 4));
    const Bytes whole = directory.bytes();
    bytes.insert(bytes.end(), whole.begin() + header, whole.end());
  }
  append(bytes, Bytes(100, 1));  // where the last ones lead
  return bytes;
}

StillBuilder& StillBuilder::maker(std::string_view text) {
  maker_ = text;
  return *this;
}

StillBuilder& StillBuilder::modelText(std::string_view text) {
  modelText_ = text;
  return *this;
}

StillBuilder& StillBuilder::segment(std::uint8_t marker, const Bytes& content) {
  append(segments_, segmentOf(marker, content));
  return *this;
}

Bytes StillBuilder::bytes() const {
  constexpr std::size_t markers = 2 + 4;  // of the file and of the comment
  const bool fitsBefore = segments_.size() <= makerOffset - markers;
  Bytes bytes = {0xFF, 0xD8};
  if (fitsBefore) append(bytes, segments_);
  const std::size_t start = bytes.size() + 4;
  Bytes comment(modelOffset - start + modelText_.size() + 1);
  std::copy(maker_.begin(), maker_.end(), comment.data() + (makerOffset - start));
  std::copy(modelText_.begin(), modelText_.end(), comment.data() + (modelOffset - start));
  append(bytes, segmentOf(0xFE, comment));
  if (!fitsBefore) append(bytes, segments_);
  const Bytes image = picture();
  bytes.insert(bytes.end(), image.begin() + 2, image.end());
  return bytes;
}

Bytes pictureThatClaims(std::uint16_t width, std::uint16_t height) {
  Bytes bytes = {0xFF, 0xD8};
  Bytes quantization(65, 1);
  quantization[0] = 0;  // the table's number; then the divisors
  quantization[1] = 8;  // of the mean: eight times the grey, of which 128 is in the middle
  append(bytes, segmentOf(0xDB, quantization));
  Bytes frame = {8};  // bits a pixel
  appendWord(frame, height, 2, ByteOrder::big);
  appendWord(frame, width, 2, ByteOrder::big);
  append(frame, {1, 1, 0x11, 0});  // one component: its number, sampling, table
  append(bytes, segmentOf(0xC0, frame));
  // How many codes there are of each length from 1 bit on, and what they stand for: sizes of
  // differences in 4 bits, and "no details" in 1.
  Bytes means = {0x00, 0, 0, 0, 10, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0};
  for (std::uint8_t size = 0; size < 10; ++size) means.push_back(size);
  append(bytes, segmentOf(0xC4, means));
  append(bytes, segmentOf(0xC4, {0x10, 1, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0x00}));
  append(bytes, segmentOf(0xDA, {1, 1, 0x00, 0, 63, 0}));
  append(bytes, scan(8, 6));
  append(bytes, {0xFF, 0xD9});
  return bytes;
}

Bytes picture() { return pictureThatClaims(64, 48); }

Bytes exampleStill() {
  return StillBuilder()
      .maker("KiVex")
      .modelText("KV-QX301")
      .exif(ExifBuilder().make("KiVex").model("KV-QX301").software("QX3.01.02.00").focalLength(15))
      .bytes();
}

std::vector<std::pair<std::string, Bytes>> namedStills() {
  const auto of = [](const ExifBuilder& exif) {
    return StillBuilder().maker("Kivex").modelText("QX2").exif(exif).bytes();
  };
  const ExifBuilder little;
  return {
      {"example.jpg", exampleStill()},
      {"no-exif.jpg", StillBuilder().maker("KiVex").modelText("QX2").bytes()},
      {"big-endian.jpg",
       of(ExifBuilder(ByteOrder::big).model("KV-QX200").software("Ver01.02").focalLength(35))},
      {"model-only.jpg", of(ExifBuilder().model("KV-QZ110").focalLength(24))},
      {"software-too-short.jpg", of(ExifBuilder().software("QX"))},
      {"software-empty.jpg", of(ExifBuilder().software(""))},
      {"software-not-text.jpg",
       of(ExifBuilder().entry(ExifBuilder::softwareTag, ExifBuilder::longType, 2, Bytes(8)))},
      {"focal-length-rational.jpg",
       of(ExifBuilder().exifEntry(ExifBuilder::focalLengthTag, ExifBuilder::rationalType, 1,
                                  little.words({31, 2}, 4)))},
      {"focal-length-claims-a-billion.jpg",
       of(ExifBuilder().exifEntry(ExifBuilder::focalLengthTag, ExifBuilder::shortType, 1000000000,
                                  little.words({0}, 4)))},
      {"maker-note.jpg", of(ExifBuilder().exifEntry(0x927C, ExifBuilder::undefinedType, 28,
                                                    bytesOf("QVC\0\0\0\0\1\0\2\0\3\0\0\0\1\0\1\0\0"
                                                            "\0\0\0\0\0\0\0\0"sv)))},
      {"exif-in-second-app1.jpg", StillBuilder()
                                      .segment(0xE1, bytesOf("http://example.org/"))
                                      .exif(ExifBuilder().software("other 1.0"))
                                      .bytes()},
      {"directories-name-each-other.jpg",
       StillBuilder().segment(0xE1, exifThatNamesDirectories(500, ByteOrder::little)).bytes()},
      {"picture-alone.jpg", picture()},
  };
}

}  // namespace oxmv::test
