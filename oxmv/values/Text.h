// Text is UTF-8 throughout. Bytes from outside that are not are taken as ISO-8859-1, so that
// nothing a clip carries is ever dropped for its encoding and a text is always valid.

#pragma once

#include <cstddef>
#include <string>
#include <string_view>

namespace oxmv {

// Whether every byte of `bytes` is below 0x80.
bool isAscii(std::string_view bytes) noexcept;

// Whether `bytes` is well-formed UTF-8 (no overlong forms, no surrogates, nothing above U+10FFFF).
bool isUtf8(std::string_view bytes) noexcept;

// Each byte as the Unicode character of the same number, in UTF-8.
std::string utf8FromLatin1(std::string_view bytes);

// Length in characters as UTF-16 counts them: one each, two for characters above U+FFFF. `utf8`
// must be valid.
std::size_t utf16Length(std::string_view utf8) noexcept;

}  // namespace oxmv
