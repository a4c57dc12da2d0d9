// The order of looks in a list.

#pragma once

#include <compare>
#include <string_view>

namespace oxmv {

// Compares two names without regard to case, nor to how accents are put together (see
// caseFolded()). A name that is not valid UTF-8 counts as bytes, of which only the ASCII letters
// have case.
std::weak_ordering compareLookNames(std::string_view one, std::string_view other);

}  // namespace oxmv
