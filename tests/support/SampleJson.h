// The JSON beside the test data: what a stream decodes to, what is to be encoded.

#pragma once

#include <span>

#include "oxmv/values/Dictionary.h"

namespace oxmv::test {

// An integer is a number without fraction and exponent; every other number is a float.
// {"$data":"00ff"} is data and {"$float":"0x7fc00000"} a float by its bits; a key that begins with
// "$" has one more "$" in front. Throws when the text is not such JSON.
Dictionary dictionaryFromJson(std::span<const std::uint8_t> text);

}  // namespace oxmv::test
