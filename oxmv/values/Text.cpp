#include "oxmv/values/Text.h"

#include <cstdint>
#include <cstring>

namespace oxmv {
namespace {

constexpr std::uint64_t highBits = 0x8080808080808080u;

std::uint8_t byteAt(std::string_view text, std::size_t i) {
  return static_cast<std::uint8_t>(text[i]);
}

template <class Word>
Word wordAt(const char* bytes) {
  Word word = 0;
  std::memcpy(&word, bytes, sizeof word);
  return word;
}

// The range of the second byte that follows `lead`; together with the count of bytes this is Table
// 3-7 of the Unicode Standard ("Well-Formed UTF-8 Byte Sequences").
struct Sequence {
  std::size_t length;  // bytes, 0 = no sequence begins with this lead
  std::uint8_t low, high;
};

constexpr Sequence sequenceOf(std::uint8_t lead) {
  if (lead >= 0xC2 && lead <= 0xDF) return {2, 0x80, 0xBF};
  if (lead == 0xE0) return {3, 0xA0, 0xBF};
  if (lead == 0xED) return {3, 0x80, 0x9F};
  if (lead >= 0xE1 && lead <= 0xEF) return {3, 0x80, 0xBF};
  if (lead == 0xF0) return {4, 0x90, 0xBF};
  if (lead >= 0xF1 && lead <= 0xF3) return {4, 0x80, 0xBF};
  if (lead == 0xF4) return {4, 0x80, 0x8F};
  return {0, 0, 0};
}

// Index of the first byte of 0x80 or above at or after `from`; the size when there is none.
std::size_t skipAscii(std::string_view bytes, std::size_t from) {
  std::size_t i = from;
  for (; bytes.size() - i >= sizeof(std::uint64_t); i += sizeof(std::uint64_t)) {
    if ((wordAt<std::uint64_t>(bytes.data() + i) & highBits) != 0) break;
  }
  while (i < bytes.size() && byteAt(bytes, i) < 0x80) ++i;
  return i;
}

}  // namespace

bool isAscii(std::string_view bytes) noexcept {
  // The last word may begin in the one before it; so that short texts need no loop over bytes.
  const char* const end = bytes.data() + bytes.size();
  if (bytes.size() < sizeof(std::uint64_t)) {
    if (bytes.size() >= sizeof(std::uint32_t))
      return ((wordAt<std::uint32_t>(bytes.data()) | wordAt<std::uint32_t>(end - 4)) &
              0x80808080u) == 0;
    return skipAscii(bytes, 0) == bytes.size();
  }
  std::uint64_t all = wordAt<std::uint64_t>(end - 8);
  for (const char* at = bytes.data(); end - at > 8; at += 8) all |= wordAt<std::uint64_t>(at);
  return (all & highBits) == 0;
}

bool isUtf8(std::string_view bytes) noexcept {
  if (isAscii(bytes)) return true;
  for (std::size_t i = skipAscii(bytes, 0); i < bytes.size(); i = skipAscii(bytes, i)) {
    const Sequence sequence = sequenceOf(byteAt(bytes, i));
    if (sequence.length == 0 || sequence.length > bytes.size() - i) return false;
    const std::uint8_t second = byteAt(bytes, i + 1);
    if (second < sequence.low || second > sequence.high) return false;
    for (std::size_t k = 2; k < sequence.length; ++k) {
      if ((byteAt(bytes, i + k) & 0xC0) != 0x80) return false;
    }
    i += sequence.length;
  }
  return true;
}

std::string utf8FromLatin1(std::string_view bytes) {
  std::string text;
  text.reserve(bytes.size() * 2);
  for (const char c : bytes) {
    const auto byte = static_cast<std::uint8_t>(c);
    if (byte < 0x80) {
      text += c;
    } else {
      text += static_cast<char>(0xC0 | byte >> 6);
      text += static_cast<char>(0x80 | (byte & 0x3F));
    }
  }
  return text;
}

std::size_t utf16Length(std::string_view utf8) noexcept {
  std::size_t units = 0;
  for (const char c : utf8) {
    const auto byte = static_cast<std::uint8_t>(c);
    units += (byte & 0xC0) != 0x80;  // a character begins
    units += byte >= 0xF0;           // and needs a surrogate pair
  }
  return units;
}

}  // namespace oxmv
