// The characters of a text, and which of them a terminal must not get: a text comes from somebody
// else's file, and must neither move the cursor nor turn a line around.

#pragma once

#include <cstddef>
#include <string>
#include <string_view>

namespace oxmv {

// One character of a UTF-8 text, or one byte that belongs to none.
struct Character {
  char32_t code;     // of the byte its number
  std::size_t size;  // in bytes
  bool isByte;
};

// `text` must not be empty.
Character firstCharacter(std::string_view text);

// The text's first characters, at most so many.
std::string_view firstCharacters(std::string_view text, std::size_t count);

// Control characters, those that change the direction of writing, and the separators of lines.
bool isHidden(char32_t code) noexcept;

// The text with "\xNN" for each ASCII control character and each byte that is not UTF-8, and
// "\u{NNNN}" for each other hidden character.
std::string visible(std::string_view text);

// How many columns a visible text takes, where each character takes one.
std::size_t columns(std::string_view text) noexcept;

}  // namespace oxmv
