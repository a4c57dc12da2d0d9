#include "oxmv/looks/Crc32.h"

#include <array>

#include "oxmv/values/LittleEndian.h"

#ifdef __x86_64__
#include <immintrin.h>
#endif

namespace oxmv {
namespace {

constexpr std::uint32_t polynomial = 0xEDB88320;

constexpr std::uint32_t shiftedBit(std::uint32_t crc) {
  return (crc & 1) != 0 ? crc >> 1 ^ polynomial : crc >> 1;
}

// Eight bytes are taken at once: entry b of table k is what byte b does to the CRC with k zero
// bytes behind it. Table 0 is the usual one.
constexpr std::size_t slices = 8;
using Tables = std::array<std::array<std::uint32_t, 256>, slices>;

constexpr Tables makeTables() {
  Tables tables = {};
  for (std::uint32_t byte = 0; byte < 256; ++byte) {
    std::uint32_t crc = byte;
    for (int bit = 0; bit < 8; ++bit) crc = shiftedBit(crc);
    tables[0][byte] = crc;
  }
  for (std::size_t k = 1; k < slices; ++k) {
    for (std::size_t byte = 0; byte < 256; ++byte) {
      const std::uint32_t crc = tables[k - 1][byte];
      tables[k][byte] = tables[0][crc & 0xFF] ^ crc >> 8;
    }
  }
  return tables;
}

// Made by the compiler, so no two threads can meet over it.
constexpr Tables tables = makeTables();

std::uint32_t updateByTable(std::uint32_t crc, const std::uint8_t* bytes, std::size_t length) {
  for (; length >= slices; bytes += slices, length -= slices) {
    const std::uint32_t low = loadLe32(bytes) ^ crc;
    const std::uint32_t high = loadLe32(bytes + 4);
    crc = tables[7][low & 0xFF] ^ tables[6][low >> 8 & 0xFF] ^ tables[5][low >> 16 & 0xFF] ^
          tables[4][low >> 24] ^ tables[3][high & 0xFF] ^ tables[2][high >> 8 & 0xFF] ^
          tables[1][high >> 16 & 0xFF] ^ tables[0][high >> 24];
  }
  for (; length > 0; ++bytes, --length) crc = tables[0][(crc ^ *bytes) & 0xFF] ^ crc >> 8;
  return crc;
}

#ifdef __x86_64__

// x to the power n modulo the polynomial, reflected, and moved up one bit: the product of two
// reflected factors comes out one bit too low.
constexpr std::int64_t power(int n) {
  std::uint32_t remainder = 0x80000000;  // x^0
  for (int i = 0; i < n; ++i) remainder = shiftedBit(remainder);
  return static_cast<std::int64_t>(std::uint64_t{remainder} << 1);
}

constexpr std::size_t lane = 16;  // bytes of one register
// So many that no product waits for the one before: a product is there after seven cycles, and each
// lane begins two in two cycles.
constexpr std::size_t laneCount = 8;
constexpr std::size_t block = laneCount * lane;

// Moves `remainder` on by the distance that `factors` stand for and adds what stands there.
__attribute__((target("avx2,pclmul"))) inline __m128i fold(__m128i remainder, __m128i factors,
                                                           __m128i next) {
  const __m128i first = _mm_clmulepi64_si128(remainder, factors, 0x00);
  const __m128i second = _mm_clmulepi64_si128(remainder, factors, 0x11);
  return _mm_xor_si128(_mm_xor_si128(first, second), next);
}

__attribute__((target("avx2,pclmul"))) inline __m128i load(const std::uint8_t* bytes) {
  return _mm_loadu_si128(reinterpret_cast<const __m128i*>(bytes));
}

// Carry-less multiplication: the first half of a register stands 64 bits further from the end than
// the second, and a factor of x^(distance + 32) or x^(distance - 32) moves each to where the next
// one stands. (V. Gopal and others, "Fast CRC Computation for Generic Polynomials Using PCLMULQDQ
// Instruction", 2009.) What is left in the end, 16 bytes, has the same CRC as all that was folded
// into it. `length` is at least one block.
__attribute__((target("avx2,pclmul"))) std::uint32_t updateByProducts(std::uint32_t crc,
                                                                      const std::uint8_t* bytes,
                                                                      std::size_t length) {
  const __m128i overBlock = _mm_set_epi64x(power(8 * block - 32), power(8 * block + 32));
  const __m128i overLane = _mm_set_epi64x(power(8 * lane - 32), power(8 * lane + 32));

  __m128i lanes[laneCount];
  for (std::size_t i = 0; i < laneCount; ++i) lanes[i] = load(bytes + i * lane);
  lanes[0] = _mm_xor_si128(lanes[0], _mm_cvtsi32_si128(static_cast<int>(crc)));
  bytes += block;
  length -= block;
  for (; length >= block; bytes += block, length -= block) {
    for (std::size_t i = 0; i < laneCount; ++i) {
      lanes[i] = fold(lanes[i], overBlock, load(bytes + i * lane));
    }
  }
  __m128i rest = lanes[0];
  for (std::size_t i = 1; i < laneCount; ++i) rest = fold(rest, overLane, lanes[i]);
  for (; length >= lane; bytes += lane, length -= lane) rest = fold(rest, overLane, load(bytes));

  std::uint8_t last[lane];
  _mm_storeu_si128(reinterpret_cast<__m128i*>(last), rest);
  return updateByTable(updateByTable(0, last, lane), bytes, length);
}

#endif

}  // namespace

void make_crc_table() noexcept {
  // There from the start; the function stays for those who call it.
}

std::uint32_t update_crc(std::uint32_t crc, const std::uint8_t* bytes, std::ptrdiff_t length,
                         Instructions instructions) noexcept {
  if (length < 1) return crc;
  const auto count = static_cast<std::size_t>(length);
#ifdef __x86_64__
  if (instructions == Instructions::vector && bestInstructions() == Instructions::vector &&
      count >= block) {
    return updateByProducts(crc, bytes, count);
  }
#else
  static_cast<void>(instructions);
#endif
  return updateByTable(crc, bytes, count);
}

std::uint32_t update_crc(std::uint32_t crc, const std::uint8_t* bytes,
                         std::ptrdiff_t length) noexcept {
  return update_crc(crc, bytes, length, bestInstructions());
}

std::uint32_t calccrc(const std::uint8_t* bytes, std::ptrdiff_t length) noexcept {
  return update_crc(0xFFFFFFFF, bytes, length) ^ 0xFFFFFFFF;
}

}  // namespace oxmv
