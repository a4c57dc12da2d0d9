#include "cli/LookTables.h"

#include <algorithm>
#include <bit>
#include <cmath>

#include "oxmv/looks/Crc32.h"
#include "oxmv/values/LittleEndian.h"

namespace oxmv::cli {
namespace {

constexpr std::size_t valueSize = 4;
constexpr std::size_t channels = 3;

class Floats {
 public:
  Floats(const OXLOOK_HEADER& header, std::span<const std::uint8_t> table)
      : table_(table), isSwapped_(isOtherByteOrder(header)) {}

  std::size_t size() const { return table_.size() / valueSize; }
  float operator[](std::size_t index) const {
    const std::uint8_t* const b = &table_[index * valueSize];
    const std::uint8_t swapped[] = {b[3], b[2], b[1], b[0]};
    return std::bit_cast<float>(loadLe32(isSwapped_ ? swapped : b));
  }

 private:
  std::span<const std::uint8_t> table_;
  bool isSwapped_;
};

// Whether each value is its point's place on that axis, 0.0 to 1.0, but for the rounding of whoever
// computed it.
bool isIdentity(const Floats& values, std::size_t size, bool isFirstFastest) {
  constexpr double rounding = 1e-6;
  if (size < 2 || values.size() != size * size * size * channels) return false;
  for (std::size_t i = 0; i < values.size(); ++i) {
    const std::size_t point = i / channels;
    const std::size_t places[] = {point % size, point / size % size, point / size / size};
    const std::size_t axis = isFirstFastest ? i % channels : channels - 1 - i % channels;
    const double expected = static_cast<double>(places[axis]) / static_cast<double>(size - 1);
    // Written so that NaN is none.
    if (!(std::abs(static_cast<double>(values[i]) - expected) <= rounding)) return false;
  }
  return true;
}

}  // namespace

TableValues valuesOf(const OXLOOK_HEADER& header, std::span<const std::uint8_t> table) {
  const Floats values(header, table);
  TableValues all;
  all.crc = calccrc(table.data(), static_cast<std::ptrdiff_t>(table.size()));
  for (std::size_t i = 0; i < values.size(); ++i) {
    const float value = values[i];
    if (!std::isfinite(value)) {
      if (all.notFinite++ == 0) all.firstNotFinite = i;
      continue;
    }
    auto& range = all.ranges[i % channels];
    if (!range) range = {value, value};
    range->least = std::min(range->least, value);
    range->most = std::max(range->most, value);
  }
  if (isIdentity(values, header.lutSize, true)) {
    all.identity = Identity::firstFastest;
  } else if (isIdentity(values, header.lutSize, false)) {
    all.identity = Identity::lastFastest;
  }
  return all;
}

std::span<const std::uint8_t> tableOf(const OXLOOK_HEADER& header, const Bytes& file) {
  constexpr std::size_t pointSize = channels * valueSize;
  const std::size_t whole = lookFileSize(static_cast<std::int32_t>(header.lutSize));
  const std::size_t there = std::min(file.size(), whole) - lookHeaderSize;
  return std::span(file).subspan(lookHeaderSize, there / pointSize * pointSize);
}

bool isOtherByteOrder(const OXLOOK_HEADER& header) noexcept { return header.magic[0] == 'K'; }

bool hasUsableSize(const OXLOOK_HEADER& header) noexcept {
  return header.lutSize >= 1 && header.lutSize <= static_cast<std::uint32_t>(maxLookSize);
}

std::optional<std::size_t> valuesWithCrc(std::span<const std::uint8_t> table, std::uint32_t crc) {
  const auto last = std::find_if(table.rbegin(), table.rend(), [](auto byte) { return byte != 0; });
  const auto used = static_cast<std::size_t>(table.rend() - last);
  std::size_t size = (used + valueSize - 1) / valueSize * valueSize;
  std::uint32_t running = update_crc(0xFFFFFFFF, table.data(), static_cast<std::ptrdiff_t>(size));
  for (; size <= table.size(); size += valueSize) {
    if ((running ^ 0xFFFFFFFF) == crc) return size / valueSize;
    if (size < table.size()) running = update_crc(running, &table[size], valueSize);
  }
  return std::nullopt;
}

}  // namespace oxmv::cli
