#include "oxmv/looks/LookTableFile.h"

#include <algorithm>

#include "oxmv/values/LittleEndian.h"
#include "oxmv/values/Text.h"

namespace oxmv {
namespace {

constexpr std::size_t nameOffset = 24;

enum class Magic { none, ours, otherOrder };

// `none` also for a file too short for the magic and the version behind it.
Magic magicOf(std::span<const std::uint8_t> start) {
  if (start.size() < 8) return Magic::none;
  const auto is = [&](std::string_view magic) {
    return std::equal(magic.begin(), magic.end(), start.begin());
  };
  if (is("OXLK")) return Magic::ours;
  if (is("KLXO")) return Magic::otherOrder;
  return Magic::none;
}

constexpr std::uint32_t inOtherOrder(std::uint32_t number) {
  return number << 24 | (number & 0xFF00) << 8 | (number >> 8 & 0xFF00) | number >> 24;
}

int hexDigit(char c) {
  if (c >= '0' && c <= '9') return c - '0';
  if (c >= 'A' && c <= 'F') return c - 'A' + 10;
  if (c >= 'a' && c <= 'f') return c - 'a' + 10;
  return -1;
}

}  // namespace

void OXLookFileRecord::reset(std::int32_t size) {
  std::fill_n(bytes_.begin(), lookHeaderSize + used_, std::uint8_t{0});
  used_ = 0;
  length_ = lookFileSize(size);
  if (bytes_.size() < length_) bytes_.resize(length_);
}

HexTable OXLookFileRecord::readTable(std::string_view utf8) {
  const HexTable table = readHexTable(utf8, bytes().subspan(lookHeaderSize));
  const auto values = bytes_.begin() + lookHeaderSize;
  const auto end = static_cast<std::ptrdiff_t>(table.stored * 4);
  if (table.stored * 4 < used_) {
    std::fill(values + end, values + static_cast<std::ptrdiff_t>(used_), std::uint8_t{0});
  }
  used_ = table.stored * 4;
  return table;
}

void storeLookHeader(const OXLOOK_HEADER& header, std::span<std::uint8_t> bytes) {
  std::copy(header.magic.begin(), header.magic.end(), bytes.begin());
  storeLe32(&bytes[4], header.version);
  storeLe32(&bytes[8], header.headerSize);
  storeLe32(&bytes[12], header.lutSize);
  storeLe32(&bytes[16], header.constantA);
  storeLe32(&bytes[20], header.constantB);
  std::copy(header.lutName.begin(), header.lutName.end(), bytes.begin() + nameOffset);
}

std::optional<OXLOOK_HEADER> loadLookHeader(std::span<const std::uint8_t> bytes) noexcept {
  const Magic magic = magicOf(bytes);
  if (magic == Magic::none || bytes.size() < lookHeaderSize) return std::nullopt;
  const auto number = [&](std::size_t offset) {
    const std::uint32_t value = loadLe32(&bytes[offset]);
    return magic == Magic::ours ? value : inOtherOrder(value);
  };
  OXLOOK_HEADER header;
  std::copy_n(bytes.begin(), header.magic.size(), header.magic.begin());
  header.version = number(4);
  header.headerSize = number(8);
  header.lutSize = number(12);
  header.constantA = number(16);
  header.constantB = number(20);
  std::copy_n(bytes.begin() + nameOffset, header.lutName.size(), header.lutName.begin());
  return header;
}

std::array<char, 40> lookNameField(std::string_view displayName) {
  // Kept on purpose: the display name is cut at 39 characters, the field takes 38. A name of 39
  // leaves it empty.
  std::array<char, 40> field = {};
  constexpr std::size_t most = 38;
  static_assert(most + 2 == sizeof field);
  if (displayName.size() <= most && isAscii(displayName)) {
    std::copy(displayName.begin(), displayName.end(), field.begin());
  }
  return field;
}

std::int32_t lookFileVersion(std::span<const std::uint8_t> start) noexcept {
  switch (magicOf(start)) {
    case Magic::none: return 0;
    case Magic::ours: return static_cast<std::int32_t>(loadLe32(&start[4]));
    case Magic::otherOrder: break;
  }
  // Kept on purpose: the second byte is dropped and the first lands in two places. For the small
  // versions there are, whose bytes but the last are 0, it is the version all the same.
  const std::uint32_t first = start[4];
  const std::uint32_t third = start[6];
  const std::uint32_t fourth = start[7];
  return static_cast<std::int32_t>(first << 24 | (first | third) << 8 | fourth);
}

std::optional<std::string> lookFileName(std::span<const std::uint8_t> start) {
  if (start.size() <= nameOffset) return "";
  const auto field = start.first(std::min(start.size(), lookHeaderSize)).subspan(nameOffset);
  const auto end = std::find(field.begin(), field.end(), 0);
  if (end == field.end() && start.size() < lookHeaderSize) return "";
  std::string name(field.begin(), end);
  if (!isAscii(name)) return std::nullopt;
  return name;
}

bool isCurrentLookFile(std::span<const std::uint8_t> start) noexcept {
  switch (magicOf(start)) {
    case Magic::none: return false;
    case Magic::ours: return loadLe32(&start[4]) == lookVersion;
    case Magic::otherOrder: return loadLe32(&start[4]) == lookVersion << 24;
  }
  return false;  // Not reached: every case is above.
}

std::string lookFileNameOf(std::uint32_t crc) {
  std::string name;
  for (int shift = 28; shift >= 0; shift -= 4) name += "0123456789ABCDEF"[crc >> shift & 0xF];
  return name + ".oxlook";
}

std::optional<std::uint32_t> crcFromFileName(std::string_view stem) noexcept {
  stem.remove_prefix(std::min(stem.find_first_not_of(" \t\n\v\f\r"), stem.size()));
  if (stem.starts_with("0x") || stem.starts_with("0X")) stem.remove_prefix(2);
  if (stem.empty() || hexDigit(stem[0]) < 0) return std::nullopt;
  std::uint32_t crc = 0;
  for (const char c : stem) {
    const int digit = hexDigit(c);
    if (digit < 0) break;
    if (crc > 0xFFFFFFF) return 0xFFFFFFFF;
    crc = crc << 4 | static_cast<std::uint32_t>(digit);
  }
  return crc;
}

std::string_view lastPathComponent(std::string_view path) noexcept {
  while (path.ends_with('/')) path.remove_suffix(1);
  const std::size_t slash = path.rfind('/');
  return slash == std::string_view::npos ? path : path.substr(slash + 1);
}

std::string_view withoutExtension(std::string_view path) noexcept {
  const std::string_view name = lastPathComponent(path);
  const std::size_t point = name.rfind('.');
  if (point == std::string_view::npos || point == 0) return path;
  return path.substr(0, static_cast<std::size_t>(name.data() - path.data()) + point);
}

std::string_view cutDisplayName(std::string_view name) noexcept {
  constexpr std::size_t most = 39;
  if (utf16Length(name) <= most) return name;
  std::size_t units = 0;
  std::size_t end = 0;
  while (end < name.size()) {
    std::size_t next = end + 1;
    while (next < name.size() && (static_cast<std::uint8_t>(name[next]) & 0xC0) == 0x80) ++next;
    units += utf16Length(name.substr(end, next - end));
    if (units > most) break;
    end = next;
  }
  return name.substr(0, end);
}

}  // namespace oxmv
