#include "oxmv/looks/LongRuns.h"

#include <array>
#include <bit>

#ifdef __x86_64__
#include <immintrin.h>
#endif

namespace oxmv {
namespace {

// No ampersand, no bracket, nothing that is not ASCII.
constexpr std::string_view runCharacters = "0123456789ABCDEFabcdef \t\r\n,\"'";

constexpr std::array<bool, 256> makeMembers() {
  std::array<bool, 256> members = {};
  for (const char c : runCharacters) members[static_cast<std::uint8_t>(c)] = true;
  return members;
}
constexpr std::array<bool, 256> members = makeMembers();

// Where the run that begins at `from` ends.
std::size_t endOfRun(std::string_view text, std::size_t from) {
  while (from < text.size() && members[static_cast<std::uint8_t>(text[from])]) ++from;
  return from;
}

#ifdef __x86_64__

// A character belongs to the runs if the entries of its low and its high four bits share a bit.
// Each high half in use has a bit of its own.
struct Halves {
  alignas(16) std::array<std::uint8_t, 16> low = {};
  alignas(16) std::array<std::uint8_t, 16> high = {};
};

constexpr Halves makeHalves() {
  Halves halves;
  std::uint8_t bit = 1;
  for (std::size_t high = 0; high < 16; ++high) {
    bool isUsed = false;
    for (std::size_t low = 0; low < 16; ++low) {
      if (!members[high << 4 | low]) continue;
      halves.low[low] = static_cast<std::uint8_t>(halves.low[low] | bit);
      isUsed = true;
    }
    if (!isUsed) continue;
    halves.high[high] = bit;
    bit = static_cast<std::uint8_t>(bit << 1);
  }
  return halves;
}
constexpr Halves halves = makeHalves();

constexpr bool halvesAreRight() {
  for (std::size_t c = 0; c < 256; ++c) {
    if (((halves.low[c & 0xF] & halves.high[c >> 4]) != 0) != members[c]) return false;
  }
  return true;
}
static_assert(halvesAreRight());

__attribute__((target("avx2"))) __m256i twice(const std::array<std::uint8_t, 16>& half) {
  return _mm256_broadcastsi128_si256(_mm_load_si128(reinterpret_cast<const __m128i*>(half.data())));
}

__attribute__((target("avx2"))) std::size_t endOfRunByVector(std::string_view text,
                                                             std::size_t from) {
  const __m256i low = twice(halves.low);
  const __m256i high = twice(halves.high);
  const __m256i fourBits = _mm256_set1_epi8(0xF);
  for (; text.size() - from >= 32; from += 32) {
    const __m256i block = _mm256_loadu_si256(reinterpret_cast<const __m256i*>(text.data() + from));
    // A byte that is not ASCII finds no entry for its low half.
    const __m256i byLow = _mm256_shuffle_epi8(low, block);
    const __m256i byHigh =
        _mm256_shuffle_epi8(high, _mm256_and_si256(_mm256_srli_epi16(block, 4), fourBits));
    const __m256i isOther =
        _mm256_cmpeq_epi8(_mm256_and_si256(byLow, byHigh), _mm256_setzero_si256());
    const auto others = static_cast<std::uint32_t>(_mm256_movemask_epi8(isOther));
    if (others != 0) return from + static_cast<std::size_t>(std::countr_zero(others));
  }
  return endOfRun(text, from);
}

#endif

using EndOfRun = std::size_t (*)(std::string_view, std::size_t);

EndOfRun endOfRunWith(Instructions instructions) {
#ifdef __x86_64__
  if (instructions == Instructions::vector && bestInstructions() == Instructions::vector) {
    return endOfRunByVector;
  }
#else
  static_cast<void>(instructions);
#endif
  return endOfRun;
}

}  // namespace

Skeleton withoutLongRuns(std::string_view document, Instructions instructions) {
  const EndOfRun endOf = endOfRunWith(instructions);
  Skeleton skeleton;
  std::size_t copied = 0;  // of the document, to the skeleton
  std::size_t at = 0;
  while ((at = document.find('>', at)) != std::string_view::npos) {
    const std::size_t start = at + 1;
    at = endOf(document, start);
    if (at - start < minLongRun || at == document.size() || document[at] != '<') continue;
    skeleton.text += document.substr(copied, start - copied);
    skeleton.places.push_back(skeleton.text.size());
    skeleton.text += '0';
    skeleton.runs.push_back({start, document.substr(start, at - start)});
    copied = at;
  }
  if (!skeleton.runs.empty()) skeleton.text += document.substr(copied);
  return skeleton;
}

}  // namespace oxmv
