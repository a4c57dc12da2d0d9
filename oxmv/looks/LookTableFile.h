// Look-table files: a header of 64 bytes, then the values of a 3-D colour table.
//
//   offset size
//        0    4  magic       "OXLK"
//        4    4  version     2
//        8    4  headerSize  64: where the table begins
//       12    4  lutSize     N, points per axis, 1 to 64
//       16    4  constantA   0x00015A01
//       20    4  constantB   0x0002160A
//       24   40  lutName     ASCII, zeros behind it; at most 38 characters
//       64       table       N x N x N points of three binary32 values, as the description has them
//
// All numbers are little-endian. The file is called after the CRC-32 of its values:
// 00ABCDEF.oxlook. Files whose magic reads "KLXO" were written in the other byte order.

#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "oxmv/looks/HexTable.h"

namespace oxmv {

constexpr std::int32_t maxLookSize = 64;  // points per axis
constexpr std::uint32_t lookVersion = 2;
constexpr std::size_t lookHeaderSize = 64;

// The fields of the header, as numbers of this machine. constantA and constantB are written as they
// are, and read by nobody.
struct OXLOOK_HEADER {
  std::array<char, 4> magic = {'O', 'X', 'L', 'K'};
  std::uint32_t version = lookVersion;
  std::uint32_t headerSize = lookHeaderSize;
  std::uint32_t lutSize = 0;
  std::uint32_t constantA = 0x00015A01;
  std::uint32_t constantB = 0x0002160A;
  std::array<char, 40> lutName = {};
};
static_assert(sizeof(OXLOOK_HEADER) == lookHeaderSize);

// How many values, and how many bytes of file, a table of N points per axis takes. N is 1 to 64.
constexpr std::size_t lookValueCount(std::int32_t size) {
  const auto n = static_cast<std::size_t>(size);
  return n * n * n * 3;
}
constexpr std::size_t lookFileSize(std::int32_t size) {
  return lookHeaderSize + lookValueCount(size) * 4;
}
static_assert(lookFileSize(maxLookSize) == 3145792);

// A look-table file in memory, byte for byte. One record serves one table after the other.
class OXLookFileRecord {
 public:
  // Makes it a record of N points per axis, 1 to 64, whose table is zero.
  void reset(std::int32_t size);

  // Fills the table from its text, from the start; see readHexTable(). What the text has no values
  // for is zero.
  HexTable readTable(std::string_view utf8);

  // The header, which is zero until LookFileRef::generateLUTFile() fills it, and the table. Valid
  // until the next reset(). The table is changed through readTable() only.
  std::span<std::uint8_t> bytes() { return std::span(bytes_).first(length_); }
  std::span<const std::uint8_t> table() const {
    return std::span(bytes_).first(length_).subspan(lookHeaderSize);
  }

 private:
  std::vector<std::uint8_t> bytes_ = std::vector<std::uint8_t>(lookHeaderSize);
  std::size_t length_ = lookHeaderSize;
  std::size_t used_ = 0;  // bytes of the table that may be other than zero
};

// Writes the header's 64 bytes to the start of a file. `bytes` has room for them.
void storeLookHeader(const OXLOOK_HEADER& header, std::span<std::uint8_t> bytes);

// The header that a file of 64 bytes or more begins with, in either byte order, which its magic
// tells. Nothing when the magic is another.
std::optional<OXLOOK_HEADER> loadLookHeader(std::span<const std::uint8_t> bytes) noexcept;

// What the name field holds for a display name: nothing but zeros when it has 39 bytes or more, or
// is not ASCII.
std::array<char, 40> lookNameField(std::string_view displayName);

// The version of a look-table file, from its first bytes (64, or all it has); 0 for any other
// magic.
std::int32_t lookFileVersion(std::span<const std::uint8_t> start) noexcept;

// The text in the name field, from the same bytes. Nothing when it is not ASCII; empty when the
// file ends before it does.
std::optional<std::string> lookFileName(std::span<const std::uint8_t> start);

// Whether these are the first bytes of a file of today's version, in either byte order: such a file
// is never written anew.
bool isCurrentLookFile(std::span<const std::uint8_t> start) noexcept;

// "00ABCDEF.oxlook"
std::string lookFileNameOf(std::uint32_t crc);

// The CRC that a file name without its extension begins with: white space, an optional 0x, digits
// up to the first character that is none; 0xFFFFFFFF if it has more than 32 bits. Nothing when
// there is no digit.
std::optional<std::uint32_t> crcFromFileName(std::string_view stem) noexcept;

// The last component of a path in which '/' separates, and a name without its extension: what
// follows the last point, unless the name begins with that.
std::string_view lastPathComponent(std::string_view path) noexcept;
std::string_view withoutExtension(std::string_view path) noexcept;

// The first characters of a display name, cut to 39 UTF-16 code units when it has 40 or more; no
// character is split. One more than the field of the file has room for.
std::string_view cutDisplayName(std::string_view name) noexcept;

}  // namespace oxmv
