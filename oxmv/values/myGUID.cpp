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

void appendHex(std::string& text, unsigned long number, int digits) {
  for (int shift = (digits - 1) * 4; shift >= 0; shift -= 4) {
    text += "0123456789ABCDEF"[(number >> shift) & 0xF];
  }
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
  std::string text;
  appendHex(text, guid.Data1, 8);
  text += '-';
  appendHex(text, guid.Data2, 4);
  text += '-';
  appendHex(text, guid.Data3, 4);
  for (std::size_t i = 0; i < guid.Data4.size(); ++i) {
    if (i == 0 || i == 2) text += '-';
    appendHex(text, guid.Data4[i], 2);
  }
  return text;
}

}  // namespace oxmv
