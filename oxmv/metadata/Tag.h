// Four-character tags.

#pragma once

#include <array>
#include <bit>
#include <cstddef>
#include <cstdint>
#include <string_view>

namespace oxmv {

// A tag as a number: its first character in the lowest byte, as the bytes stand in a stream. Any
// four bytes are a tag.
enum class Tag : std::uint32_t {};

constexpr Tag tagOf(std::array<std::uint8_t, 4> bytes) {
  std::uint32_t code = 0;
  for (std::size_t i = 4; i-- > 0;) code = code << 8 | bytes[i];
  return Tag{code};
}

// The characters of a tag, in reading order; they need not be ASCII.
constexpr std::array<char, 4> charactersOf(Tag tag) {
  // What the loop gives here, which compilers do not see.
  if constexpr (std::endian::native == std::endian::little)
    return std::bit_cast<std::array<char, 4>>(tag);
  std::array<char, 4> characters{};
  for (std::size_t i = 0; i < 4; ++i)
    characters[i] = static_cast<char>(static_cast<std::uint32_t>(tag) >> (8 * i) & 0xFF);
  return characters;
}

// "REEL"_tag; anything but four ASCII characters does not compile.
consteval Tag operator""_tag(const char* characters, std::size_t length) {
  if (length != 4) throw "a tag has four characters";
  std::array<std::uint8_t, 4> bytes{};
  for (std::size_t i = 0; i < 4; ++i) {
    bytes[i] = static_cast<std::uint8_t>(characters[i]);
    if (bytes[i] >= 0x80) throw "a tag is ASCII";
  }
  return tagOf(bytes);
}

}  // namespace oxmv
