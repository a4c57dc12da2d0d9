// The one block of memory behind a decoded stream. Internal: hosts meet it only inside Value and
// Dictionary.
//
// A decoded stream keeps its own bytes, and every value is either a scalar or a place in those
// bytes. So a decode costs one allocation, and neither taking a value out nor copying a dictionary
// copies a payload.
//
//   block      := Slot[] Key[] bytes
//   dictionary := header slot, then a slot for each value; its keys stand together in the keys
//   list       := header slot, then a slot for each element
//
// The keys of a dictionary with many names are followed by their order by text, so that a look-up
// among them is a binary search: a stream may bring names by the ten thousand, chosen by somebody
// else.

#pragma once

#include <array>
#include <bit>
#include <cstddef>
#include <cstdint>
#include <span>
#include <string_view>

#include "oxmv/values/Shared.h"

namespace oxmv::detail {

// A form has its Value::Kind in the bits from here on, so that asking for that takes no branch and no
// table.
constexpr int kindShift = 2;

// How a value is held. From `text` on it needs the owner of its payload.
enum class Form : std::uint8_t {
  nothing,
  integer = 1 << kindShift,     // body: two's complement
  integer64,                    // in Value only: one that needs more bits
  float32 = 2 << kindShift,     // body: its bits
  float64 = 3 << kindShift,     // in Value only
  text = 4 << kindShift,        // place: UTF-8 (checked before it is handed out)
  textToNul,                    // place: as `text`, but ends at its first NUL; in slots only
  wholeText,                    // all bytes of the owner, a Block
  wholeDerivedText,             // the same, of a derived string kind
  data = 5 << kindShift,        // place
  wholeData,                    // all bytes of the owner, a Block
  floats = 6 << kindShift,      // place: little-endian binary32
  integers,                     // place: little-endian 32-bit two's complement
  list,                         // body: index of the header slot
  arrayBox,                     // the owner, an ArrayBox
  dictionary = 7 << kindShift,  // body: index of the header slot
  dictionaryBox,                // the owner, a Table
};

// A value in 8 bytes: a scalar in `body`, or a place: `size` bytes at offset `body` of the block's
// bytes.
//
// They are the halves of one word. As two members they would go through other registers on the way
// to a Value, and whoever asks for its kind would wait for them.
class Slot {
 public:
  constexpr Slot() = default;
  constexpr Slot(std::uint32_t formAndSize, std::uint32_t body)
      : word_(formAndSize | std::uint64_t{body} << 32) {}

  // Sizes come from records, whose size field has 24 bits; a name that had to be converted to UTF-8
  // may take twice as many bytes.
  static constexpr std::uint32_t maxSize = 0x3FFFFFF;

  static constexpr Slot scalar(Form form, std::uint32_t body) {
    return {static_cast<std::uint32_t>(form), body};
  }
  static constexpr Slot place(Form form, std::uint32_t size, std::uint32_t offset) {
    return {static_cast<std::uint32_t>(form) | size << sizeShift, offset};
  }

  constexpr Form form() const { return static_cast<Form>(word_ & (lentBit - 1)); }
  constexpr std::uint32_t size() const { return formAndSize() >> sizeShift; }
  constexpr std::uint32_t body() const { return static_cast<std::uint32_t>(word_ >> 32); }
  constexpr std::uint32_t formAndSize() const { return static_cast<std::uint32_t>(word_); }

  // The mark of a Value that has no share in its payload. No slot of a block has it.
  constexpr bool isLent() const { return (word_ & lentBit) != 0; }
  constexpr Slot lent() const { return Slot(word_ | lentBit); }
  constexpr Slot kept() const { return Slot(word_ & ~std::uint64_t{lentBit}); }

  constexpr bool operator==(const Slot&) const = default;

  static constexpr int formBits = 5;
  static constexpr std::uint32_t lentBit = 1u << formBits;
  static constexpr int sizeShift = formBits + 1;
  static_assert(static_cast<int>(Form::dictionaryBox) < 1 << formBits, "every form fits");

 private:
  constexpr explicit Slot(std::uint64_t word) : word_(word) {}

  std::uint64_t word_ = 0;
};

// A dictionary's key in 4 bytes: the characters of a key of four ASCII characters, or where the
// text stands. A text of four ASCII characters is always held the first way, so two keys of
// different ways are never equal.
class Key {
 public:
  static constexpr Key tag(std::string_view fourAscii) {
    return Key({fourAscii[0], fourAscii[1], fourAscii[2], fourAscii[3]});
  }
  // `slot` is the index of a slot of form `text`.
  static constexpr Key textAt(std::uint32_t slot) {
    return Key({byte(slot >> 24 | 0x80), byte(slot >> 16), byte(slot >> 8), byte(slot)});
  }
  static constexpr bool fits(std::string_view text) {
    return text.size() == 4 && ((text[0] | text[1] | text[2] | text[3]) & 0x80) == 0;
  }

  constexpr bool isTag() const { return (characters_[0] & 0x80) == 0; }
  std::string_view tagText() const { return {characters_.data(), characters_.size()}; }
  constexpr std::uint32_t slot() const {
    return (number(0) & 0x7F) << 24 | number(1) << 16 | number(2) << 8 | number(3);
  }
  constexpr bool operator==(const Key& other) const {
    return std::bit_cast<std::uint32_t>(characters_) ==
           std::bit_cast<std::uint32_t>(other.characters_);
  }

 private:
  constexpr explicit Key(std::array<char, 4> characters) : characters_(characters) {}
  static constexpr char byte(std::uint32_t number) { return static_cast<char>(number & 0xFF); }
  constexpr std::uint32_t number(std::size_t i) const {
    return static_cast<std::uint8_t>(characters_[i]);
  }

  std::array<char, 4> characters_;
};

// The header slot of a list or dictionary.
struct Header {
  std::uint32_t count;
  bool sorted;             // the keys are followed by their order by text
  std::uint32_t firstKey;  // dictionaries only

  constexpr Slot slot() const { return {count | (sorted ? sortedBit : 0u), firstKey}; }
  static constexpr Header of(Slot slot) {
    return {slot.formAndSize() & ~sortedBit, (slot.formAndSize() & sortedBit) != 0, slot.body()};
  }
  static constexpr std::uint32_t sortedBit = 0x80000000u;
};

class Block final : public Shared {
 public:
  // One allocation that holds copies of all that is given; the bytes are `head` followed by `tail`.
  // So many zeros stand behind them, for those who read texts several bytes at a time.
  static constexpr std::size_t readAhead = 32;
  static Ref<const Block> make(std::span<const std::uint8_t> head, std::string_view tail,
                               std::span<const Slot> slots, std::span<const Key> keys);

  std::span<const std::uint8_t> bytes() const { return {bytes_, byteCount_}; }
  std::span<const std::uint8_t> bytes(Slot place) const {
    return {bytes_ + place.body(), place.size()};
  }
  std::string_view text(Slot place) const {
    return {reinterpret_cast<const char*>(bytes_) + place.body(), place.size()};
  }
  Header header(std::uint32_t index) const { return Header::of(slots_[index]); }
  const Slot* items(std::uint32_t headerIndex) const { return slots_ + headerIndex + 1; }

  const Key* keys(std::uint32_t headerIndex) const { return keys_ + header(headerIndex).firstKey; }
  // The key stands among those of this block.
  std::string_view keyText(const Key& key) const {
    return key.isTag() ? key.tagText() : text(nameOf(key));
  }
  // Of a key that is no tag.
  Slot nameOf(const Key& key) const { return slots_[key.slot()]; }
  // Whether a dictionary holds all others: it is the last one made.
  bool isOutermost(std::uint32_t headerIndex) const {
    return headerIndex + 1 + header(headerIndex).count == slotCount_;
  }
  // The slot of the value under `key` in the dictionary of that header; null when it has no such
  // key.
  const Slot* find(std::uint32_t headerIndex, std::string_view key) const;

  static void operator delete(void* memory) { ::operator delete(memory); }

 private:
  Block() = default;
  static void* operator new(std::size_t size, std::size_t trailing) {
    return ::operator new(size + trailing);
  }
  static void operator delete(void* memory, std::size_t) { ::operator delete(memory); }

  const std::uint8_t* bytes_ = nullptr;
  std::size_t byteCount_ = 0;
  const Slot* slots_ = nullptr;
  std::size_t slotCount_ = 0;
  const Key* keys_ = nullptr;
};

// Where a key that is a tag stands; `count` when it is nowhere. Reads up to Block::readAhead bytes
// behind the last key.
std::size_t placeOf(Key wanted, const Key* keys, std::size_t count);

}  // namespace oxmv::detail
