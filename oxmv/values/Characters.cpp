#include "oxmv/values/Characters.h"

#include <algorithm>
#include <cstdint>

#include "oxmv/values/Text.h"

namespace oxmv {
namespace {

// As many hexadecimal digits as the number has, but at least `width`.
std::string hexadecimal(char32_t number, std::size_t width) {
  std::string digits;
  for (; number != 0 || digits.size() < width; number >>= 4)
    digits.insert(digits.begin(), "0123456789ABCDEF"[number & 0xF]);
  return digits;
}

std::size_t lengthOfSequence(std::uint8_t lead) {
  if (lead < 0x80) return 1;
  if (lead < 0xE0) return 2;
  return lead < 0xF0 ? 3 : 4;
}

}  // namespace

Character firstCharacter(std::string_view text) {
  const auto lead = static_cast<std::uint8_t>(text.front());
  const std::size_t size = lengthOfSequence(lead);
  if (size == 1) return {lead, 1, false};
  if (size > text.size() || !isUtf8(text.substr(0, size))) return {lead, 1, true};
  char32_t code = lead & (0xFFu >> (size + 1));
  for (std::size_t i = 1; i < size; ++i)
    code = code << 6 | (static_cast<std::uint8_t>(text[i]) & 0x3F);
  return {code, size, false};
}

std::string_view firstCharacters(std::string_view text, std::size_t count) {
  std::size_t size = 0;
  for (; count > 0 && size < text.size(); --count) size += firstCharacter(text.substr(size)).size;
  return text.substr(0, size);
}

bool isHidden(char32_t code) noexcept {
  const auto isWithin = [code](char32_t first, char32_t last) {
    return first <= code && code <= last;
  };
  return code < 0x20 || isWithin(0x7F, 0x9F) || code == 0x061C || isWithin(0x200E, 0x200F) ||
         isWithin(0x2028, 0x202E) || isWithin(0x2066, 0x2069);
}

std::string visible(std::string_view text) {
  // Nearly every text is plain.
  if (std::all_of(text.begin(), text.end(), [](char c) { return c >= ' ' && c < 0x7F; }))
    return std::string(text);
  std::string shown;
  shown.reserve(text.size());
  while (!text.empty()) {
    const Character next = firstCharacter(text);
    if (next.isByte || (isHidden(next.code) && next.code < 0x80)) {
      shown += "\\x" + hexadecimal(next.code, 2);
    } else if (isHidden(next.code)) {
      shown += "\\u{" + hexadecimal(next.code, 4) + "}";
    } else {
      shown += text.substr(0, next.size);
    }
    text.remove_prefix(next.size);
  }
  return shown;
}

std::size_t columns(std::string_view text) noexcept {
  return static_cast<std::size_t>(std::count_if(text.begin(), text.end(), [](char c) {
    return (static_cast<std::uint8_t>(c) & 0xC0) != 0x80;
  }));
}

}  // namespace oxmv
