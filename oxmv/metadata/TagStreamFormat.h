// The tag stream's fixed numbers.
//
//   stream := record (marker? record)*
//   record := tag[4] size:u24le type:u8 payload[size] pad[0..3]
//   marker := BF FE count:u16be
//
// A stream has no header, no count and no terminator. A record is padded to 4 bytes, counted from
// its start. No marker stands before the first record.
//
// A record's length, from its start to the next record's, keeps 24 bits: sizes of 0xFFFFF5 and more
// wrap to a length of 0, 4 or 8. Kept on purpose: readers everywhere step like this, so a stream
// must be stepped over like this.

#pragma once

#include <array>
#include <cstddef>
#include <cstdint>

namespace oxmv {

constexpr std::size_t recordHeaderSize = 8;
constexpr std::uint32_t maxRecordSize = 0xFFFFFF;

// Fewer bytes than the shortest record that holds a number are not taken for a stream when a clip
// is loaded.
constexpr std::size_t shortestData = 12;

constexpr std::uint32_t paddedToFour(std::uint32_t size) { return (size + 3) & ~3u; }

// `size` has 24 bits, so nothing overflows before the mask.
constexpr std::uint32_t recordLength(std::uint32_t size) { return (size + 11) & 0xFFFFFC; }

// The greatest size whose record's length does not wrap.
constexpr std::uint32_t longestRecord = 0xFFFFF4;
static_assert(recordLength(longestRecord) == recordHeaderSize + longestRecord);
static_assert(recordLength(longestRecord + 1) == 0);

// The stream goes on for 4 x count bytes behind its given length; the marker's own bytes are
// counted nowhere.
constexpr std::size_t markerSize = 4;
constexpr std::array<std::uint8_t, 2> markerBytes = {0xBF, 0xFE};

// The two integers before the nested stream of a control point.
constexpr std::uint32_t controlPointSize = 8;

// Their dictionary key. No record has it: it is longer than a tag.
constexpr const char* controlPointKey = "CTLPData";

// A record's type byte. Readers go by the tag; only the values of the two groups are told apart by
// it.
namespace recordType {
constexpr std::uint8_t nested = 0;
constexpr std::uint8_t text = 'c';  // and raw data
constexpr std::uint8_t integerL = 'L';
constexpr std::uint8_t integerH = 'H';
constexpr std::uint8_t integerR = 'R';
constexpr std::uint8_t small = 'B';
constexpr std::uint8_t fourCC = 'F';
constexpr std::uint8_t floats = 'f';
constexpr std::uint8_t guid = 'G';
}  // namespace recordType

// A record's second word; `size` has 24 bits.
constexpr std::uint32_t headerWord(std::uint8_t type, std::uint32_t size) {
  return std::uint32_t{type} << 24 | size;
}

// How many streams may stand within one another, the outermost counted. Streams nest by payload,
// and clips nest once or twice: deeper than this only hostile input goes. Decoder, encoder and tag
// JSON keep to the same number.
constexpr int maxNesting = 64;

}  // namespace oxmv
