// What stands among 32 bytes, found in one step. Internal.

#pragma once

#include <cstddef>
#include <cstdint>

#include "oxmv/values/LittleEndian.h"

#if defined(__SSE2__)
#include <immintrin.h>
#endif

namespace oxmv::detail {

// A bit for each of the 32 bytes, the lowest for the first.
struct ByteMasks {
  static constexpr std::uint32_t width = 32;

  std::uint32_t nul;   // those that are NUL
  std::uint32_t high;  // those that are no ASCII
};

#if defined(__SSE2__)

// All 32 bytes are read.
inline ByteMasks masksOf(const std::uint8_t* bytes) {
  const auto low = _mm_loadu_si128(reinterpret_cast<const __m128i*>(bytes));
  const auto high = _mm_loadu_si128(reinterpret_cast<const __m128i*>(bytes) + 1);
  const auto joined = [](int ofLow, int ofHigh) {
    return static_cast<std::uint32_t>(ofLow) | static_cast<std::uint32_t>(ofHigh) << 16;
  };
  const __m128i nul = _mm_setzero_si128();
  return {joined(_mm_movemask_epi8(_mm_cmpeq_epi8(low, nul)),
                 _mm_movemask_epi8(_mm_cmpeq_epi8(high, nul))),
          joined(_mm_movemask_epi8(low), _mm_movemask_epi8(high))};
}

#else

// All 32 bytes are read.
inline ByteMasks masksOf(const std::uint8_t* bytes) {
  constexpr std::uint64_t lowBits = 0x7F7F7F7F7F7F7F7Fu;
  // The highest bits of eight bytes, side by side: the product brings each to its place in the
  // highest byte, and no two meet on the way.
  const auto gathered = [](std::uint64_t word) {
    return static_cast<std::uint32_t>(((word & ~lowBits) >> 7) * 0x0102040810204080u >> 56);
  };
  ByteMasks masks{0, 0};
  for (std::uint32_t i = 0; i < ByteMasks::width; i += 8) {
    const std::uint64_t word = loadLe64(bytes + i);
    masks.nul |= gathered(~(((word & lowBits) + lowBits) | word)) << i;
    masks.high |= gathered(word) << i;
  }
  return masks;
}

#endif

}  // namespace oxmv::detail
