// Some tags of a stream, without the others.

#pragma once

#include <cstdint>
#include <span>
#include <vector>

#include "oxmv/metadata/Tag.h"
#include "oxmv/values/Value.h"

namespace oxmv {

// The values that decodeStream() gives these tags, nothing for those that it does not have. A
// stream of well-formed records is only stepped over, which is several times as fast, and numbers
// and texts are all that is made of it; any other, and other kinds of values, are decoded. `values`
// is one for each tag, and keeps its memory from call to call.
void pickTags(std::span<const std::uint8_t> stream, std::span<const Tag> tags,
              std::vector<Value>& values);

}  // namespace oxmv
