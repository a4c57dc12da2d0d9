#include "oxmv/looks/HexTable.h"

#include <algorithm>
#include <array>
#include <bit>
#include <cstring>
#include <string>

#ifdef __x86_64__
#include <immintrin.h>
#endif

namespace oxmv {
namespace {

constexpr std::size_t groupDigits = 8;
constexpr std::size_t valueBytes = 4;

constexpr std::uint8_t notADigit = 0xFF;

constexpr std::array<std::uint8_t, 256> makeDigits() {
  std::array<std::uint8_t, 256> digits = {};
  digits.fill(notADigit);
  for (std::uint8_t i = 0; i < 10; ++i) digits[std::uint8_t{'0'} + i] = i;
  for (std::uint8_t i = 0; i < 6; ++i) {
    digits[std::uint8_t{'A'} + i] = digits[std::uint8_t{'a'} + i] =
        static_cast<std::uint8_t>(10 + i);
  }
  return digits;
}
constexpr std::array<std::uint8_t, 256> digitValues = makeDigits();

std::uint8_t digitValue(char c) { return digitValues[static_cast<std::uint8_t>(c)]; }
bool isDigit(char c) { return digitValue(c) != notADigit; }
bool isAscii(char c) { return static_cast<std::uint8_t>(c) < 0x80; }

// Decodes up to `most` groups that follow each other, all of which lie within the text; stops at
// the first that is not all digits. Answers how many that were.
std::size_t decodeGroups(const char* text, std::size_t most, std::uint8_t* values) {
  for (std::size_t i = 0; i < most; ++i, text += groupDigits, values += valueBytes) {
    std::uint8_t bytes[valueBytes];
    unsigned all = 0;  // only notADigit has a bit above the lowest four
    for (std::size_t k = 0; k < valueBytes; ++k) {
      const unsigned high = digitValue(text[2 * k]);
      const unsigned low = digitValue(text[2 * k + 1]);
      all |= high | low;
      bytes[k] = static_cast<std::uint8_t>(high << 4 | low);
    }
    if (all > 0xF) return i;
    std::copy_n(bytes, valueBytes, values);
  }
  return most;
}

#ifdef __x86_64__

constexpr std::size_t inBlock = 32 / groupDigits;

struct Decoded {
  __m128i values;
  std::uint32_t others;  // a bit for each character that is no digit
};

__attribute__((target("avx2"))) inline Decoded decodeBlock(__m256i block) {
  // Comparisons are signed: what is not ASCII is below everything, and no digit.
  const __m256i isDecimal = _mm256_and_si256(_mm256_cmpgt_epi8(block, _mm256_set1_epi8('0' - 1)),
                                             _mm256_cmpgt_epi8(_mm256_set1_epi8('9' + 1), block));
  const __m256i lowerCase = _mm256_or_si256(block, _mm256_set1_epi8(0x20));
  const __m256i isLetter =
      _mm256_and_si256(_mm256_cmpgt_epi8(lowerCase, _mm256_set1_epi8('a' - 1)),
                       _mm256_cmpgt_epi8(_mm256_set1_epi8('f' + 1), lowerCase));
  const auto digits =
      static_cast<std::uint32_t>(_mm256_movemask_epi8(_mm256_or_si256(isDecimal, isLetter)));

  // '0' is 0x30 and 'a' 0x61, 'A' 0x41: the low four bits, and 9 more for a letter.
  const __m256i nibbles = _mm256_add_epi8(_mm256_and_si256(block, _mm256_set1_epi8(0xF)),
                                          _mm256_and_si256(isLetter, _mm256_set1_epi8(9)));
  // Every even digit times 16 plus the odd one, 16 bits each; then those packed into bytes.
  const __m256i pairs = _mm256_maddubs_epi16(nibbles, _mm256_set1_epi16(0x0110));
  return {_mm_packus_epi16(_mm256_castsi256_si128(pairs), _mm256_extracti128_si256(pairs, 1)),
          ~digits};
}

__attribute__((target("avx2"))) inline void store(std::uint8_t* bytes, __m128i values) {
  _mm_storeu_si128(reinterpret_cast<__m128i*>(bytes), values);
}

__attribute__((target("avx2"))) std::size_t decodeGroupsByVector(const char* text, std::size_t most,
                                                                 std::uint8_t* values) {
  std::size_t done = 0;
  while (most - done >= inBlock) {
    const Decoded block = decodeBlock(
        _mm256_loadu_si256(reinterpret_cast<const __m256i*>(text + done * groupDigits)));
    if (block.others != 0) {
      // Only the groups before the first other character.
      const auto whole = static_cast<std::size_t>(std::countr_zero(block.others)) / groupDigits;
      std::uint8_t decoded[inBlock * valueBytes];
      store(decoded, block.values);
      for (std::size_t i = 0; i < whole; ++i) {
        std::copy_n(decoded + i * valueBytes, valueBytes, values + (done + i) * valueBytes);
      }
      return done + whole;
    }
    store(values + done * valueBytes, block.values);
    done += inBlock;
  }
  return done + decodeGroups(text + done * groupDigits, most - done, values + done * valueBytes);
}

// The same for groups that each have a gap behind them and begin `stride` characters apart, all
// within the text: four at a time, so that none waits for the one before. Answers a multiple of
// four.
__attribute__((target("avx2"))) std::size_t decodeSpacedByVector(const char* text, std::size_t most,
                                                                 std::size_t stride,
                                                                 std::uint8_t* values) {
  const auto load = [](const char* group) {
    std::int64_t digits = 0;
    std::memcpy(&digits, group, sizeof digits);
    return digits;
  };
  std::size_t done = 0;
  for (; most - done >= inBlock; done += inBlock, text += inBlock * stride) {
    for (std::size_t i = 0; i < inBlock; ++i) {
      for (std::size_t k = groupDigits; k < stride; ++k) {
        if (isDigit(text[i * stride + k]) || !isAscii(text[i * stride + k])) return done;
      }
    }
    const Decoded block = decodeBlock(_mm256_set_epi64x(
        load(text + 3 * stride), load(text + 2 * stride), load(text + stride), load(text)));
    if (block.others != 0) return done;
    store(values + done * valueBytes, block.values);
  }
  return done;
}

#endif

struct Decoder {
  std::size_t (*groups)(const char* text, std::size_t most, std::uint8_t* values);
  // Null: spaced groups are taken like any others.
  std::size_t (*spaced)(const char* text, std::size_t most, std::size_t stride,
                        std::uint8_t* values);
};

Decoder decoderFor(Instructions instructions) {
#ifdef __x86_64__
  if (instructions == Instructions::vector && bestInstructions() == Instructions::vector) {
    return {decodeGroupsByVector, decodeSpacedByVector};
  }
#else
  static_cast<void>(instructions);
#endif
  return {decodeGroups, nullptr};
}

class Scan {
 public:
  Scan(std::string_view text, std::span<std::uint8_t> values, Decoder decoder)
      : text_(text), values_(values), decoder_(decoder) {}

  // False when a character is met that is not ASCII: bytes are not the unit then.
  bool run() {
    std::size_t at = 0;
    if (!skipToDigit(at, text_.size())) return false;
    table.leading = at;
    const std::size_t end = text_.size() - at;  // from here on no group begins
    while (at < end) {
      const std::size_t count = wholeGroups(at, end);
      at += groupDigits * count;
      if (count == 0 && !oneGroup(at)) return false;
      const std::size_t gap = at;
      if (!skipToDigit(at, end)) return false;
      if (count == 1 && at > gap && at < end) {
        at += spacedGroups(at, end, groupDigits + at - gap);
        if (!skipToDigit(at, end)) return false;
      }
    }
    const std::size_t rest = std::min(at, text_.size());
    return std::all_of(text_.begin() + static_cast<std::ptrdiff_t>(rest), text_.end(), isAscii);
  }

  HexTable table;

 private:
  std::size_t room() const { return values_.size() / valueBytes - table.stored; }

  bool skipToDigit(std::size_t& at, std::size_t end) const {
    while (at < end && !isDigit(text_[at])) {
      if (!isAscii(text_[at++])) return false;
    }
    return true;
  }

  // Takes the groups from `at` on, one after the other, until one is not in order. Answers how
  // many.
  std::size_t wholeGroups(std::size_t at, std::size_t end) {
    const std::size_t beginning = (end - at + groupDigits - 1) / groupDigits;
    const std::size_t whole = (text_.size() - at) / groupDigits;
    const std::size_t count =
        decoder_.groups(text_.data() + at, std::min({beginning, whole, room()}),
                        values_.data() + table.stored * valueBytes);
    table.groups += count;
    table.stored += count;
    return count;
  }

  // Takes groups with gaps like the one before the first. Answers how many characters those are.
  std::size_t spacedGroups(std::size_t at, std::size_t end, std::size_t stride) {
    constexpr std::size_t widest = groupDigits + 4;
    if (decoder_.spaced == nullptr || stride > widest) return 0;
    const std::size_t beginning = (end - at + stride - 1) / stride;
    const std::size_t whole = (text_.size() - at) / stride;
    const std::size_t count =
        decoder_.spaced(text_.data() + at, std::min({beginning, whole, room()}), stride,
                        values_.data() + table.stored * valueBytes);
    table.groups += count;
    table.stored += count;
    return count * stride;
  }

  // Takes the group at a digit, whatever its characters are, and steps over it.
  bool oneGroup(std::size_t& at) {
    std::uint8_t value[valueBytes] = {};
    const std::string_view group = text_.substr(at, groupDigits);
    if (!std::all_of(group.begin(), group.end(), isAscii)) return false;
    if (group.size() < groupDigits || decodeGroups(group.data(), 1, value) == 0) {
      if (table.malformed++ == 0) table.firstMalformed = at;
    }
    if (room() > 0) {
      std::copy_n(value, valueBytes, values_.data() + table.stored * valueBytes);
      ++table.stored;
    } else if (table.firstSurplus == HexTable::none) {
      table.firstSurplus = at;
    }
    ++table.groups;
    at += groupDigits;
    return true;
  }

  std::string_view text_;
  std::span<std::uint8_t> values_;
  Decoder decoder_;
};

// One character for each UTF-16 code unit, a question mark for those that are not ASCII.
std::string codeUnits(std::string_view utf8) {
  std::string units;
  units.reserve(utf8.size());
  for (const char c : utf8) {
    const auto byte = static_cast<std::uint8_t>(c);
    if (byte < 0x80) {
      units += c;
    } else if (byte >= 0xC0) {  // a character begins
      units.append(byte >= 0xF0 ? 2 : 1, '?');
    }
  }
  return units;
}

}  // namespace

HexTable readHexTable(std::string_view utf8, std::span<std::uint8_t> values,
                      Instructions instructions) {
  Scan scan(utf8, values, decoderFor(instructions));
  if (scan.run()) return scan.table;

  // What the first scan stored need not be what this one will, and it may have stored more.
  std::fill_n(values.begin(), scan.table.stored * valueBytes, std::uint8_t{0});
  const std::string units = codeUnits(utf8);
  Scan again(units, values, decoderFor(instructions));
  again.run();
  again.table.isAscii = false;
  return again.table;
}

}  // namespace oxmv
