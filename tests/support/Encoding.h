// Encoding as the tests do it.

#pragma once

#include <string>
#include <string_view>
#include <vector>

#include "oxmv/metadata/TagStreamEncoder.h"
#include "oxmv/values/Dictionary.h"
#include "tests/support/StreamBuilder.h"

namespace oxmv::test {

// What a dictionary is encoded to. The test fails if that is nothing.
Bytes encoded(const Dictionary& tags, Layout layout = Layout::exact);

// The tags of a stream's records, by stepping over their padded lengths: only for streams in which
// every size is what it says.
std::vector<std::string> tagsIn(const Bytes& stream);

}  // namespace oxmv::test
