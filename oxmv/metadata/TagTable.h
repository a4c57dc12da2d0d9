// The table of tags: every fact about a tag stands once, in its row.

#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <span>
#include <string>
#include <string_view>

#include "oxmv/metadata/Tag.h"
#include "oxmv/metadata/TagStreamFormat.h"
#include "oxmv/values/Block.h"

namespace oxmv {

// How the decoder reads a record of the tag. Integers and floats are little-endian.
enum class Read : std::uint8_t {
  none,          // no rule: the record is skipped
  text,          // text up to its first NUL
  int32,         // signed
  uint8,         // from the payload's first byte
  uint16,        // from its first two bytes
  float32,       // binary32
  floats,        // a list of `count` floats, if the size is exactly theirs
  integers,      // a list of as many int32 as the size holds
  data,          // bytes
  guid,          // bytes; and they become the object's GUID
  nested,        // a nested stream, unless the size is 0
  texts,         // one text of the whole payload, appended to the tag's list
  ints,          // one int32, appended to the tag's list
  nestedList,    // a nested stream, appended to the tag's list
  controlPoint,  // two int32 and a nested stream, appended to the tag's list
  tagName,       // the name of the next entry of the "TAG " group
  tagValue,      // its value
  regName,       // the name of the next entry of the "REG " group
  regValue,      // its value
};

// How the encoder writes a value under the tag: the letter is the record's type.
enum class Write : std::uint8_t {
  none,          // no rule: the value is dropped
  timecode,      // 'c', the text without room for a NUL
  text,          // 'c', the text and a NUL
  float32,       // 'f'
  integerH,      // 'H'
  integerL,      // 'L'
  integerR,      // 'R'
  word16,        // 'B', the low 16 bits
  byte8,         // 'B', the low 8 bits
  fourCC,        // 'F', the first four characters of a text
  guid,          // 'G', bytes
  data,          // 'c', bytes
  floatPair,     // 'f', two floats, or three: a list of three is written as a triple
  floats,        // 'f', `count` floats
  integerArray,  // 'H', one record for all elements
  integerEach,   // 'H', one record an element
  textEach,      // 'c', one record an element
  nestedEach,    // a nested stream an element
  nested,        // a nested stream
  controlPoint,  // two integers and a nested stream an element
  tagGroup,      // TAGN and TAGV records
  regGroup,      // REGN and REGV records
};

// The type of the records that a rule writes; of a group, of its names.
constexpr std::uint8_t recordTypeOf(Write rule) {
  switch (rule) {
    case Write::timecode:
    case Write::text:
    case Write::data:
    case Write::textEach:
    case Write::tagGroup:
    case Write::regGroup: return recordType::text;
    case Write::float32:
    case Write::floatPair:
    case Write::floats: return recordType::floats;
    case Write::integerH:
    case Write::integerArray:
    case Write::integerEach: return recordType::integerH;
    case Write::integerL: return recordType::integerL;
    case Write::integerR: return recordType::integerR;
    case Write::word16:
    case Write::byte8: return recordType::small;
    case Write::fourCC: return recordType::fourCC;
    case Write::guid: return recordType::guid;
    case Write::none:
    case Write::nestedEach:
    case Write::nested:
    case Write::controlPoint: break;
  }
  return recordType::nested;
}

// What may be stored under the tag by key.
enum class Accept : std::uint8_t {
  unknown,  // not by key: enters a dictionary by decoding only, or whole dictionary at once
  any,      // any value
  number,   // a number
  array,    // a value of `count` elements
  never,    // known, and always refused: the data tags
};

// When the encoder writes the tag.
enum class When : std::uint8_t {
  inOrder,   // where the dictionary's own order has it
  leading,   // before all others
  deferred,  // after all others
};

struct TagRow {
  Tag tag;
  Read read;
  Write write;
  Accept accept;
  std::uint8_t count = 0;       // elements of a float list
  std::string_view label = {};  // what people call it; empty for most tags
  When when = When::inOrder;
};

// Every row, in the order of the tags' characters.
std::span<const TagRow> tagRows() noexcept;

// The row of a tag; null when there is none.
const TagRow* findTagRow(Tag tag) noexcept;

namespace detail {

// How a record becomes a slot, as numbers to calculate with: where a record of `tag` has a size
// from `least` to `least + range`, and all of its payload is there, the masks and the form make it.
// Of tags whose records need more than that no size is in the range.
struct PlainRule {
  Tag tag{};
  Read read = Read::none;
  Form form = Form::nothing;
  std::uint32_t least = 0xFFFFFFFF;
  std::uint32_t range = 0;
  std::uint32_t numberMask = 0;  // what counts of the payload's first four bytes; of a place, none
  std::uint32_t placeMask = 0;   // of a place, all bits of its offset and size
};

// How a slot becomes a record, as numbers to calculate with: where it is of `form`, the masks make
// its payload. A text ends at its first NUL. Lengths other than `least` to `least + range` are not
// plain. The record's size is the length and `room`, padded.
struct alignas(32) PlainWrite {
  Tag tag{};
  Form form = Form::arrayBox;  // which no slot is of
  std::uint8_t least = 0xFF;
  std::uint8_t range = 0;
  std::uint8_t room = 0;
  std::uint32_t header = 0;      // the second word of the record's, for a size of 0
  std::uint32_t numberMask = 0;  // what counts of a number; of a place, none
  std::uint32_t placeMask = 0;   // of a place, all bits of its offset
  std::uint32_t textMask = 0;    // of a text, all its bytes may end it
};

// By the tag's slot, which is another one for each tag: the index of its row; noRow = of no tag.
constexpr std::size_t tagSlotCount = 2048;
constexpr std::uint8_t noRow = 0xFF;
extern const std::array<std::uint8_t, tagSlotCount> rowOfSlot;
// By the index of a row; at noRow, the rule of no tag.
extern const std::array<PlainRule, noRow + 1> plainRules;
extern const std::array<PlainWrite, noRow + 1> plainWrites;

// One multiplication spreads the tags over the slots so that no two meet (found by trying; checked
// where the table is).
constexpr std::size_t slotOfTag(Tag tag) {
  return (static_cast<std::uint32_t>(tag) * 0x94BC4E1Bu) >> 21;
}

// The index of the row of `tag`, if it has one. Of any other tag it is that of some row or noRow.
inline std::uint8_t likelyRow(Tag tag) { return rowOfSlot[slotOfTag(tag)]; }

}  // namespace detail

// The row of a dictionary key; null when it is not one of the tags.
const TagRow* findTagRow(std::string_view key) noexcept;

// The three rules in a few words, for people: "4 floats", "f 16", "array of 4". A rule that does
// nothing is "-".
std::string readsAs(const TagRow& row);
std::string writesAs(const TagRow& row);
std::string acceptsAs(const TagRow& row);

}  // namespace oxmv
