#include "tests/support/CollidingNames.h"

#include <algorithm>
#include <array>
#include <bit>
#include <cstdint>

namespace oxmv::test {
namespace {

// The hash takes a text in words of 8 bytes, in the byte order of the machine:
//
//   hash := seed ^ length * m;   for each word: hash := (hash ^ scrambled(word)) * m;   finish
//   scrambled(word) := folded(word * m) * m,   folded(x) := x ^ x >> 47
//
// Every step can be undone: m is odd, and to fold twice is to do nothing (47 is more than half of
// 64). So for any first word there is one second word that brings the hash to any wanted value.
constexpr std::uint64_t m = 0xC6A4A7935BD1E995u;
constexpr std::uint64_t seed = 0xC70F6907u;
constexpr std::uint64_t wanted = 0x0123456789ABCDEFu;

// Newton's iteration: each round doubles the number of low bits that are right.
constexpr std::uint64_t inverseOf(std::uint64_t odd) {
  std::uint64_t inverse = odd;  // right in its low 3 bits
  for (int bits = 3; bits < 64; bits *= 2) inverse *= 2 - odd * inverse;
  return inverse;
}

constexpr std::uint64_t unM = inverseOf(m);
static_assert(m * unM == 1);

constexpr std::uint64_t folded(std::uint64_t x) { return x ^ x >> 47; }
constexpr std::uint64_t scrambled(std::uint64_t word) { return folded(word * m) * m; }
constexpr std::uint64_t unscrambled(std::uint64_t word) { return folded(word * unM) * unM; }

void append(std::string& text, std::uint64_t word) {
  const auto bytes = std::bit_cast<std::array<char, sizeof word>>(word);
  text.append(bytes.begin(), bytes.end());
}

}  // namespace

std::vector<std::string> collidingNames(std::size_t count) {
  constexpr std::uint64_t letters = 0x6161616161616161u;  // "aaaaaaaa"
  constexpr std::uint64_t highBits = 0x8080808080808080u;
  std::vector<std::string> names;
  for (std::uint64_t number = 0; names.size() < count; ++number) {
    // A letter for each 4 bits of the number.
    std::uint64_t first = letters;
    for (unsigned i = 0; i < 8; ++i) first += (number >> 4 * i & 0xF) << 8 * i;
    const std::uint64_t hash = ((seed ^ 16 * m) ^ scrambled(first)) * m;
    const std::uint64_t second = unscrambled(hash ^ wanted);
    // One in 256 is ASCII. The others would not be UTF-8 and change when they are converted. A NUL
    // at the end would be taken for padding.
    if ((second & highBits) != 0) continue;
    std::string name;
    append(name, first);
    append(name, second);
    if (name.back() == '\0') continue;
    names.push_back(name);
  }
  return names;
}

}  // namespace oxmv::test
