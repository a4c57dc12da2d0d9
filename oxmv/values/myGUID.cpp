#include "oxmv/values/myGUID.h"

#include <algorithm>

namespace oxmv {
namespace {

constexpr std::size_t data2At = sizeof(unsigned long);
constexpr std::size_t data3At = data2At + 2;
constexpr std::size_t data4At = data3At + 2;
constexpr std::size_t fieldsEnd =
    data4At + 8;  // padding behind this is in the image, and in no field

// Puts one byte of a little-endian field in place.
template <class Word>
void setByte(Word& word, std::size_t index, std::uint8_t byte) {
  const std::size_t shift = index * 8;
  word = static_cast<Word>((word & ~(Word{0xFF} << shift)) | (Word{byte} << shift));
}

// Writes the digits of a number up to `end`, the last of them in front of it.
void putHex(char* end, unsigned long number, int digits) {
  for (; digits > 0; --digits, number >>= 4) *--end = "0123456789ABCDEF"[number & 0xF];
}

// The value of a hexadecimal digit; 16 for any other character.
unsigned digitOf(char c) {
  if (c >= '0' && c <= '9') return static_cast<unsigned>(c - '0');
  if (c >= 'a' && c <= 'f') return static_cast<unsigned>(c - 'a') + 10;
  if (c >= 'A' && c <= 'F') return static_cast<unsigned>(c - 'A') + 10;
  return 16;
}

}  // namespace

void copyOverImage(myGUID& guid, std::span<const std::uint8_t> image) noexcept {
  const std::size_t count = std::min(image.size(), fieldsEnd);
  for (std::size_t i = 0; i < count; ++i) {
    if (i < data2At) {
      setByte(guid.Data1, i, image[i]);
    } else if (i < data3At) {
      setByte(guid.Data2, i - data2At, image[i]);
    } else if (i < data4At) {
      setByte(guid.Data3, i - data3At, image[i]);
    } else {
      guid.Data4[i - data4At] = image[i];
    }
  }
}

std::string guidText(const myGUID& guid) {
  std::string text(36, '-');
  char* const start = text.data();
  putHex(start + 8, guid.Data1, 8);
  putHex(start + 13, guid.Data2, 4);
  putHex(start + 18, guid.Data3, 4);
  const auto& last = guid.Data4;
  putHex(start + 23, static_cast<unsigned long>(last[0] << 8 | last[1]), 4);
  for (std::size_t i = 2; i < last.size(); ++i) putHex(start + 22 + 2 * i, last[i], 2);
  return text;
}

std::optional<myGUID> guidFromText(std::string_view text) noexcept {
  constexpr std::string_view form = "xxxxxxxx-xxxx-xxxx-xxxx-xxxxxxxxxxxx";
  if (text.size() != form.size()) return std::nullopt;
  std::array<std::uint8_t, 16> bytes{};  // in the order of the text
  std::size_t digits = 0;
  for (std::size_t i = 0; i < form.size(); ++i) {
    const unsigned digit = digitOf(text[i]);
    if (form[i] == '-' ? text[i] != '-' : digit == 16) return std::nullopt;
    if (form[i] == '-') continue;
    bytes[digits / 2] = static_cast<std::uint8_t>(bytes[digits / 2] * 16u + digit);
    ++digits;
  }
  const auto word = [&](std::size_t at) {
    return static_cast<std::uint16_t>(bytes[at] << 8 | bytes[at + 1]);
  };
  myGUID guid{(static_cast<unsigned long>(word(0)) << 16) | word(2), word(4), word(6), {}};
  std::copy(bytes.begin() + 8, bytes.end(), guid.Data4.begin());
  return guid;
}

}  // namespace oxmv
