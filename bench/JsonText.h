// A clip as JSON text, for the peers that read that.

#pragma once

#include <string>

#include "oxmv/values/Dictionary.h"

namespace bench {

// Floats are written with the fewest digits that give them back, and always with a point or an
// exponent, so that they come back as what they were.
std::string jsonTextOf(const oxmv::Dictionary& content);

}  // namespace bench
