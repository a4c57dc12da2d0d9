// Thirty-two bytes, looked at and copied in one step. Internal: for the loops over texts, most of
// which are shorter.

#pragma once

#include <array>
#include <cstddef>
#include <cstdint>

#include "oxmv/values/LittleEndian.h"

#ifdef __SSE2__
#include <immintrin.h>
#endif

namespace oxmv::detail {

// On every machine. A set of bytes is a bit for each, the lowest for the first.
class PortableBytes32 {
 public:
  static constexpr std::size_t size = 32;

  // `bytes` are 32 that may be read.
  static PortableBytes32 at(const std::uint8_t* bytes) {
    PortableBytes32 read;
    for (std::size_t i = 0; i < words; ++i) read.words_[i] = loadLe64(bytes + 8 * i);
    return read;
  }

  // Those that are NUL or not ASCII.
  std::uint32_t ends() const {
    // A byte of ASCII reaches the highest bit with 0x7F added, unless it is NUL.
    return bitsOf([](std::uint64_t word) { return ~((word & ~highBits) + ~highBits) | word; });
  }
  std::uint32_t nuls() const {
    return bitsOf([](std::uint64_t word) { return ~(((word & ~highBits) + ~highBits) | word); });
  }
  // Those of 0x80 and above.
  std::uint32_t notAscii() const {
    return bitsOf([](std::uint64_t word) { return word; });
  }

  // The first `count` bytes, at most 32, and zeros; the first four of them with the bits of `word`.
  // Writes 32 bytes.
  void store(std::uint8_t* to, std::size_t count, std::uint32_t word) const {
    for (std::size_t i = 0; i < words; ++i) {
      const std::size_t left = count > 8 * i ? count - 8 * i : 0;
      std::uint64_t kept = words_[i];
      if (left < 8) kept &= (std::uint64_t{1} << 8 * left) - 1;
      if (i == 0) kept |= word;
      storeLe32(to + 8 * i, static_cast<std::uint32_t>(kept));
      storeLe32(to + 8 * i + 4, static_cast<std::uint32_t>(kept >> 32));
    }
  }

 private:
  static constexpr std::size_t words = 4;
  static constexpr std::uint64_t highBits = 0x8080808080808080u;

  // The highest bits of the bytes of what `function` makes of each word.
  template <class Function>
  std::uint32_t bitsOf(Function function) const {
    std::uint32_t bits = 0;
    for (std::size_t i = 0; i < words; ++i) {
      // The factor brings the lowest bit of each byte to its place in the highest one.
      const std::uint64_t ones = (function(words_[i]) & highBits) >> 7;
      bits |= static_cast<std::uint32_t>(ones * 0x0102040810204080u >> 56) << 8 * i;
    }
    return bits;
  }

  std::array<std::uint64_t, words> words_;
};

#ifdef __SSE2__

// The same by the instructions that every x86-64 processor has.
class Bytes32 {
 public:
  static constexpr std::size_t size = 32;

  static Bytes32 at(const std::uint8_t* bytes) { return {load(bytes), load(bytes + 16)}; }

  // Comparisons are signed: what is not ASCII is below zero.
  std::uint32_t ends() const {
    const __m128i one = _mm_set1_epi8(1);
    return bitsOf(_mm_cmpgt_epi8(one, first_), _mm_cmpgt_epi8(one, second_));
  }
  std::uint32_t nuls() const {
    const __m128i zero = _mm_setzero_si128();
    return bitsOf(_mm_cmpeq_epi8(first_, zero), _mm_cmpeq_epi8(second_, zero));
  }
  std::uint32_t notAscii() const { return bitsOf(first_, second_); }

  void store(std::uint8_t* to, std::size_t count, std::uint32_t word) const {
    const std::uint8_t* mask = masks.data() + (size - count);
    const __m128i number = _mm_cvtsi32_si128(static_cast<int>(word));
    put(to, _mm_or_si128(_mm_and_si128(first_, load(mask)), number));
    put(to + 16, _mm_and_si128(second_, load(mask + 16)));
  }

 private:
  Bytes32(__m128i first, __m128i second) : first_(first), second_(second) {}

  static __m128i load(const std::uint8_t* bytes) {
    return _mm_loadu_si128(reinterpret_cast<const __m128i*>(bytes));
  }
  static void put(std::uint8_t* to, __m128i bytes) {
    _mm_storeu_si128(reinterpret_cast<__m128i*>(to), bytes);
  }
  static std::uint32_t bitsOf(__m128i first, __m128i second) {
    return static_cast<std::uint32_t>(_mm_movemask_epi8(first)) |
           static_cast<std::uint32_t>(_mm_movemask_epi8(second)) << 16;
  }

  // As many bytes that keep as bytes that clear: the mask of `count` begins so far before the
  // middle.
  static constexpr auto masks = [] {
    std::array<std::uint8_t, 2 * size> made{};
    for (std::size_t i = 0; i < size; ++i) made[i] = 0xFF;
    return made;
  }();

  __m128i first_, second_;
};

#else

using Bytes32 = PortableBytes32;

#endif

}  // namespace oxmv::detail
