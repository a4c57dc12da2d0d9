// Little-endian words, put together by arithmetic: the same on every machine, at any alignment.

#pragma once

#include <algorithm>
#include <array>
#include <bit>
#include <cstdint>

namespace oxmv {

constexpr std::uint32_t loadLe16(const std::uint8_t* b) {
  return static_cast<std::uint32_t>(b[0]) | static_cast<std::uint32_t>(b[1]) << 8;
}

constexpr std::uint32_t loadLe24(const std::uint8_t* b) {
  return loadLe16(b) | static_cast<std::uint32_t>(b[2]) << 16;
}

constexpr std::uint32_t loadLe32(const std::uint8_t* b) {
  return loadLe24(b) | static_cast<std::uint32_t>(b[3]) << 24;
}

constexpr std::uint64_t loadLe64(const std::uint8_t* b) {
  return loadLe32(b) | static_cast<std::uint64_t>(loadLe32(b + 4)) << 32;
}

constexpr void storeLe32(std::uint8_t* b, std::uint32_t word) {
  // What the shifts give here; compilers take two words after one another apart.
  if constexpr (std::endian::native == std::endian::little) {
    const auto bytes = std::bit_cast<std::array<std::uint8_t, sizeof word>>(word);
    std::copy(bytes.begin(), bytes.end(), b);
    return;
  }
  b[0] = static_cast<std::uint8_t>(word);
  b[1] = static_cast<std::uint8_t>(word >> 8);
  b[2] = static_cast<std::uint8_t>(word >> 16);
  b[3] = static_cast<std::uint8_t>(word >> 24);
}

}  // namespace oxmv
