#include "tests/support/StreamBuilder.h"

#include <algorithm>
#include <bit>
#include <stdexcept>

namespace oxmv::test {
namespace {

// The lowest `count` bytes of a word, the lowest first.
Bytes littleEndian(std::uint32_t word, int count) {
  Bytes bytes;
  for (int i = 0; i < count; ++i) {
    bytes.push_back(static_cast<std::uint8_t>(word % 256));
    word /= 256;
  }
  return bytes;
}

}  // namespace

Bytes bytesOf(std::string_view text) { return {text.begin(), text.end()}; }

Bytes repeated(const Bytes& pattern, std::size_t size) {
  Bytes bytes(size);
  std::size_t done = std::min(size, pattern.size());
  std::copy_n(pattern.begin(), done, bytes.begin());
  while (done < size) {  // twice as much each time
    const std::size_t count = std::min(done, size - done);
    std::copy_n(bytes.begin(), count, bytes.begin() + static_cast<std::ptrdiff_t>(done));
    done += count;
  }
  return bytes;
}

StreamBuilder& StreamBuilder::record(std::string_view tag, char type, const Bytes& payload) {
  header(tag, static_cast<std::uint32_t>(payload.size()), type).raw(payload);
  while (bytes_.size() % 4 != 0) bytes_.push_back(0);
  return *this;
}

StreamBuilder& StreamBuilder::record(std::string_view tag, char type, std::string_view payload) {
  return record(tag, type, bytesOf(payload));
}

StreamBuilder& StreamBuilder::record(std::string_view tag, char type, std::int32_t payload) {
  return record(tag, type, littleEndian(static_cast<std::uint32_t>(payload), 4));
}

StreamBuilder& StreamBuilder::record(std::string_view tag, char type, float payload) {
  return record(tag, type, littleEndian(std::bit_cast<std::uint32_t>(payload), 4));
}

StreamBuilder& StreamBuilder::header(std::string_view tag, std::uint32_t size, char type) {
  if (tag.size() != 4) throw std::invalid_argument("a tag has four characters");
  return raw(bytesOf(tag)).raw(littleEndian(size, 3)).raw({static_cast<std::uint8_t>(type)});
}

StreamBuilder& StreamBuilder::marker(std::uint16_t count) {
  return raw(
      {0xBF, 0xFE, static_cast<std::uint8_t>(count / 256), static_cast<std::uint8_t>(count % 256)});
}

StreamBuilder& StreamBuilder::raw(const Bytes& bytes) {
  bytes_.insert(bytes_.end(), bytes.begin(), bytes.end());
  return *this;
}

StreamBuilder& StreamBuilder::dropLast(std::size_t count) {
  bytes_.resize(bytes_.size() - count);
  return *this;
}

}  // namespace oxmv::test
