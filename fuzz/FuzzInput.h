// The fuzzer's bytes as choices: numbers, texts, values, whole dictionaries.

#pragma once

#include <algorithm>
#include <bit>
#include <cstddef>
#include <cstdint>
#include <span>
#include <string>
#include <utility>
#include <vector>

#include "oxmv/metadata/TagStreamFormat.h"
#include "oxmv/metadata/TagTable.h"
#include "oxmv/values/Array.h"
#include "oxmv/values/Dictionary.h"

namespace oxmv::fuzz {

inline std::string keyOf(const TagRow& row) {
  const auto characters = charactersOf(row.tag);
  return {characters.begin(), characters.end()};
}

// Takes its choices from the front, a byte or more each. Once the bytes are used up every choice is
// 0, which is always one that ends what is being made.
class FuzzInput {
 public:
  // Without doubles for what keeps only floats.
  enum class Doubles : std::uint8_t { made, none };

  explicit FuzzInput(std::span<const std::uint8_t> bytes, Doubles doubles = Doubles::made)
      : bytes_(bytes), doubles_(doubles) {}

  // What is left, to be taken as it is.
  std::span<const std::uint8_t> rest() const { return bytes_; }

  std::span<const std::uint8_t> take(std::size_t most) {
    const auto taken = bytes_.first(std::min(most, bytes_.size()));
    bytes_ = bytes_.subspan(taken.size());
    return taken;
  }
  // `end` is 256 at the most.
  std::size_t below(std::size_t end) { return static_cast<std::size_t>(word(1) % end); }
  std::uint64_t word(std::size_t byteCount) {
    std::uint64_t made = 0;
    for (const std::uint8_t byte : take(byteCount)) made = made << 8 | byte;
    return made;
  }

  // Of any bytes, or in ASCII; short, or about as long as records can be.
  std::string text() {
    const std::size_t head = below(256);
    const bool isAscii = head < 0x80;
    if ((head & 0x60) == 0x60) {
      constexpr std::size_t lengths[] = {64, 253, 254, 255, 256, 257, 300, 1000};
      std::string made(lengths[head % 8], static_cast<char>('a' + below(26)));
      if (!isAscii) made.insert(below(256) % made.size(), "\u00E9");
      return made;
    }
    std::string made;
    for (const std::uint8_t byte : take(head & 0x1F))
      made += static_cast<char>(isAscii ? byte & 0x7F : byte);
    return made;
  }

  const TagRow& row() { return tagRows()[below(256) % tagRows().size()]; }

  // Mostly of the kind that the tag carries.
  Value valueFor(const TagRow& row, int depth) {
    return below(8) == 7 ? anyValue(depth) : fittingValue(row, depth);
  }

  // Mostly of tags; nested so deep at the most.
  Dictionary dictionary(int depth) {
    Dictionary made;
    for (std::size_t count = below(8); count > 0; --count) {
      if (below(16) == 15) {
        made.set(text(), anyValue(depth));
      } else {
        const TagRow& tag = row();
        made.set(keyOf(tag), valueFor(tag, depth));
      }
    }
    return made;
  }

  // An element of the lists that have a record for each.
  Value elementFor(const TagRow& row, int depth) {
    switch (row.write) {
      case Write::textEach: return text();
      case Write::nestedEach: return nested(depth);
      case Write::controlPoint: return controlPoint(depth);
      default: return integer();
    }
  }

 private:
  Value fittingValue(const TagRow& row, int depth) {
    switch (row.write) {
      case Write::timecode:
      case Write::text:
      case Write::fourCC: return text();
      case Write::float32: return number();
      case Write::none:
      case Write::integerH:
      case Write::integerL:
      case Write::integerR:
      case Write::word16:
      case Write::byte8: return integer();
      case Write::guid: return data(below(4) == 3 ? below(40) : 16);
      case Write::data: return data(dataSize());
      case Write::floatPair:
      case Write::floats: return array(row.count, [&] { return number(); });
      case Write::integerArray: return array(1 + below(3), [&] { return integer(); });
      case Write::integerEach:
      case Write::textEach:
      case Write::nestedEach:
      case Write::controlPoint: return array(below(4), [&] { return elementFor(row, depth); });
      case Write::nested: return nested(depth);
      case Write::tagGroup:
      case Write::regGroup: return group();
    }
    return 0;
  }

  Value anyValue(int depth) {
    switch (below(7)) {
      case 0: return integer();
      case 1: return number();
      case 2: return text();
      case 3: return data(dataSize());
      case 4: return nested(depth);
      case 5: return group();
      default: return depth > 0 ? array(below(5), [&] { return anyValue(depth - 1); }) : Array();
    }
  }

  Value nested(int depth) { return depth > 0 ? dictionary(depth - 1) : Dictionary(); }

  Value controlPoint(int depth) {
    Dictionary made = nested(depth).dictionary();
    const std::size_t count = below(8);
    if (count < 4) made.set(controlPointKey, array(count == 3 ? 3 : 2, [&] { return integer(); }));
    return made;
  }

  Value group() {
    Dictionary made;
    for (std::size_t count = below(4); count > 0; --count) {
      const std::string name = text();
      switch (below(8)) {
        case 0: made.set(name, number()); break;
        case 1: made.set(name, Value::derivedText(text())); break;
        case 2:
        case 3: made.set(name, text()); break;
        default: made.set(name, integer()); break;
      }
    }
    return made;
  }

  template <class Element>
  static Value array(std::size_t count, Element element) {
    std::vector<Value> elements;
    for (std::size_t i = 0; i < count; ++i) elements.push_back(element());
    return Array(std::move(elements));
  }

  Value integer() {
    switch (below(4)) {
      case 0: return static_cast<std::int32_t>(below(256));
      case 1: return static_cast<std::int32_t>(word(4));
      case 2: return static_cast<std::int64_t>(word(8));
      default: {
        const std::size_t choice = below(256);
        const std::int64_t power = std::int64_t{1} << choice % 63;
        return (choice & 0x80) != 0 ? -power : power - static_cast<std::int64_t>(choice >> 6 & 1);
      }
    }
  }

  Value number() {
    switch (below(8)) {
      case 0: return integer();
      case 1:
        if (doubles_ == Doubles::made) return std::bit_cast<double>(word(8));
        [[fallthrough]];
      case 2: return std::bit_cast<float>(static_cast<std::uint32_t>(word(4)));
      default: return static_cast<float>(below(256)) / 64.0f;
    }
  }

  std::size_t dataSize() {
    const std::size_t choice = below(256);
    // About as much as 16 bits tell; once, for such inputs are slow.
    if (choice == 255 && !std::exchange(hasLongData_, true)) return 65528 + below(16);
    return choice < 128 ? choice % 8 * 4 : choice % 24;
  }

  // Of that size: what the input does not have is 0.
  Value data(std::size_t size) {
    const auto given = take(std::min<std::size_t>(size, 16));
    std::vector<std::uint8_t> made(given.begin(), given.end());
    made.resize(size);
    return Value::data(made);
  }

  std::span<const std::uint8_t> bytes_;
  const Doubles doubles_;
  bool hasLongData_ = false;
};

}  // namespace oxmv::fuzz
