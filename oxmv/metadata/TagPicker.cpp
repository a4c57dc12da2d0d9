#include "oxmv/metadata/TagPicker.h"

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <limits>
#include <string_view>

#include "oxmv/metadata/TagStreamDecoder.h"
#include "oxmv/metadata/TagStreamFormat.h"
#include "oxmv/metadata/TagTable.h"
#include "oxmv/values/Dictionary.h"
#include "oxmv/values/LittleEndian.h"

namespace oxmv {
namespace {

// The value of a record whose payload is all there. Answers false when that takes a decoder.
bool interpret(const TagRow& row, std::span<const std::uint8_t> payload, Value& value) {
  switch (row.read) {
    case Read::text: {
      const auto end = std::find(payload.begin(), payload.end(), std::uint8_t{0});
      value = std::string_view(reinterpret_cast<const char*>(payload.data()),
                               static_cast<std::size_t>(end - payload.begin()));
      return true;
    }
    case Read::uint8:
      if (payload.empty()) return false;
      value = std::int32_t{payload[0]};
      return true;
    case Read::uint16:
      if (payload.size() < 2) return false;
      value = static_cast<std::int32_t>(loadLe16(payload.data()));
      return true;
    case Read::int32:
      if (payload.size() < 4) return false;
      value = static_cast<std::int32_t>(loadLe32(payload.data()));
      return true;
    case Read::none:
    case Read::float32:
    case Read::floats:
    case Read::integers:
    case Read::data:
    case Read::guid:
    case Read::nested:
    case Read::texts:
    case Read::ints:
    case Read::nestedList:
    case Read::controlPoint:
    case Read::tagName:
    case Read::tagValue:
    case Read::regName:
    case Read::regValue: return false;
  }
  return false;  // Not reached: every case is above.
}

// One of 64 bits for a tag. Most tags that nobody asked for have a bit of their own.
std::uint64_t bitOf(std::uint32_t tag) { return std::uint64_t{1} << (tag * 0x9E3779B1u >> 26); }

// The key of a group: its value comes from records of other tags.
bool isGroup(Tag tag) {
  const TagRow* row = findTagRow(tag);
  return row != nullptr && (row->write == Write::tagGroup || row->write == Write::regGroup);
}

// Answers false when the stream needs a decoder: at a marker, at a record that is not whole, or
// whose length wraps, and for values of other kinds.
bool step(std::span<const std::uint8_t> stream, std::span<const Tag> tags,
          std::span<Value> values) {
  std::uint64_t bits = 0;
  for (const Tag tag : tags) bits |= bitOf(static_cast<std::uint32_t>(tag));
  std::size_t at = 0;
  while (at < stream.size()) {
    const std::size_t left = stream.size() - at;
    if (left < recordHeaderSize) return false;
    const std::uint8_t* header = stream.data() + at;
    const std::uint32_t tag = loadLe32(header);
    const std::uint32_t size = loadLe32(header + 4) & maxRecordSize;
    const bool isMarker = at > 0 && header[0] == markerBytes[0] && header[1] == markerBytes[1];
    if (isMarker || size > longestRecord || left - recordHeaderSize < size) return false;
    const auto wanted =
        (bits & bitOf(tag)) != 0 ? std::find(tags.begin(), tags.end(), Tag{tag}) : tags.end();
    if (wanted != tags.end()) {
      const TagRow* row = findTagRow(*wanted);
      const auto index = static_cast<std::size_t>(wanted - tags.begin());
      const auto payload = stream.subspan(at + recordHeaderSize, size);
      if (row == nullptr || !interpret(*row, payload, values[index])) return false;
    }
    at += recordLength(size);
  }
  return true;
}

}  // namespace

void pickTags(std::span<const std::uint8_t> bytes, std::span<const Tag> tags,
              std::vector<Value>& values) {
  // As much as a decoder looks at.
  constexpr std::size_t most = std::numeric_limits<std::int32_t>::max();
  const auto stream = bytes.first(std::min(bytes.size(), most));
  values.assign(tags.size(), Value());
  if (std::none_of(tags.begin(), tags.end(), isGroup) && step(stream, tags, values)) {
    // Of a tag that is asked for twice the first one has it.
    for (std::size_t i = 0; i < tags.size(); ++i)
      values[i] = values[static_cast<std::size_t>(std::find(tags.begin(), tags.end(), tags[i]) -
                                                  tags.begin())];
    return;
  }
  const Dictionary all = decodeStream(stream, static_cast<std::int32_t>(stream.size()));
  for (std::size_t i = 0; i < tags.size(); ++i) {
    const auto characters = charactersOf(tags[i]);
    values[i] = all[{characters.data(), characters.size()}];
  }
}

}  // namespace oxmv
