// A stream cut into what its readers step over.

#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <vector>

#include "oxmv/metadata/StreamObserver.h"
#include "oxmv/metadata/TagStreamDecoder.h"

namespace oxmv::test {

// A record with its padding; or, without a tag, a marker or what trails behind all records.
struct StreamPart {
  std::optional<Tag> tag;
  std::vector<std::uint8_t> bytes;
  std::size_t there;  // how many of the bytes are in the stream; padding may lack
  bool isMarker = false;
};

// All of them together are the stream, and the padding that may lack at its end.
inline std::vector<StreamPart> partsOf(std::span<const std::uint8_t> stream) {
  class Cutter final : public StreamObserver {
   public:
    explicit Cutter(std::span<const std::uint8_t> bytes) : bytes_(bytes) {}

    void onRecord(const Record& record) override {
      if (record.level == 0) add(record.tag, record.offset, std::max(record.length, 8u));
    }
    void onMarker(std::size_t at, std::uint32_t, int level) override {
      if (level != 0) return;
      add(std::nullopt, at, 4);
      parts_.back().isMarker = true;
    }
    std::vector<StreamPart> finish() {
      if (end_ < bytes_.size()) add(std::nullopt, end_, bytes_.size() - end_);
      return std::move(parts_);
    }

   private:
    void add(std::optional<Tag> tag, std::size_t begin, std::size_t length) {
      const auto part = bytes_.subspan(begin, std::min(length, bytes_.size() - begin));
      end_ = begin + part.size();
      parts_.push_back({tag, {part.begin(), part.end()}, part.size(), false});
      parts_.back().bytes.resize((part.size() + 3) / 4 * 4);
    }

    const std::span<const std::uint8_t> bytes_;
    std::size_t end_ = 0;
    std::vector<StreamPart> parts_;
  };
  Cutter cutter(stream);
  decodeStream(stream, static_cast<std::int32_t>(stream.size()), nullptr, &cutter);
  return cutter.finish();
}

// The bytes of those that are no records of these tags. What is no whole record may be one in one
// stream and trail in another.
inline std::vector<std::uint8_t> bytesWithout(std::span<const Tag> tags,
                                              const std::vector<StreamPart>& parts) {
  std::vector<std::uint8_t> bytes;
  for (const StreamPart& part : parts) {
    const bool isNamed = part.tag && std::find(tags.begin(), tags.end(), *part.tag) != tags.end();
    if (!isNamed) bytes.insert(bytes.end(), part.bytes.begin(), part.bytes.end());
  }
  return bytes;
}

}  // namespace oxmv::test
