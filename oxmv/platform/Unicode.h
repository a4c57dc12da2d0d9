// What the Unicode Standard knows about characters.

#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace oxmv {

// The text with differences of case taken out (full case folding) and its characters composed, so
// that two texts whose foldings are equal differ in nothing but case and in how their accents are
// put together: canonical caseless matching, definition D145 of the Unicode Standard. Nothing when
// it is not valid UTF-8.
std::optional<std::string> caseFolded(std::string_view utf8);

// The text without the punctuation (general categories P*: brackets, quotation marks, dashes ...;
// no symbols, so no plus sign) at both ends. `utf8` must be valid.
std::string_view trimmedOfPunctuation(std::string_view utf8) noexcept;

}  // namespace oxmv
